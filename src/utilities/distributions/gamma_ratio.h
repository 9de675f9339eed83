// Fast regularised incomplete gamma ratios P(a, x) and Q(a, x) for the
// distribution functions of the gamma family (gamma, chi-square, Poisson).
//
// The smaller tail is computed directly and the other one as its complement:
// Temme's uniform expansion for a >= 40 and |1 - x/a| <= 0.25, and GRATIO's
// series for a < 1 and x < 1.1 (ACM TOMS 654, DiDonato & Morris 1986);
// otherwise the power series of P or Legendre's
// continued fraction of Q (evaluated by the modified Lentz method, Thompson &
// Barnett 1986) times the prefactor x^a e^-x / Gamma(a + 1) in Loader's
// saddle-point form, which keeps its relative accuracy for large a.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_GAMMA_RATIO_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_GAMMA_RATIO_H

namespace qel {
namespace gammaratio {

// Both tails for finite a > 0 and x > 0 when the direct tail is at least
// 1e-280 (at shapes beyond the ELV routines, from Temme's expansion: any
// tail, 0 below about 2e-306); false
// otherwise (deep tails, non-convergence), and
// the caller takes the ELV routine, which carries tails as logarithms.
bool tails(double a, double x, double* lower, double* upper);

// tails() at the default, full precision of the ELV routines; false under the
// historical setting, whose callers expect the ELV routines' own iterations.
bool fastTails(double a, double x, double* lower, double* upper);

}  // namespace gammaratio
}  // namespace qel

#endif
