// Both tails of the regularised incomplete beta ratio I_x(a, b) for the
// distribution functions of the beta and binomial laws, by BRATIO of ACM
// TOMS 708 (DiDonato & Morris 1992), which forms the smaller tail directly
// and the other as its complement, each to about the rounding level.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_BETA_RATIO_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_BETA_RATIO_H

namespace qel {
namespace betaratio {

// lower = I_x(a, b), upper = 1 - I_x(a, b), with y = 1 - x given apart. True
// at the default, full precision of the ELV routines when BRATIO answers and
// the smaller tail is at least 1e-280; false otherwise (the historical ELV
// setting, deep tails), and the caller takes the ELV routine, which carries
// tails as logarithms down to the smallest normal double.
bool fastTails(double a, double b, double x, double y, double* lower, double* upper);

// Both tails from BRATIO whatever their size, at either precision setting:
// for shapes beyond the ELV routines, which have no other route. A tail
// below 1e-280 may have lost digits (it is below every tail the library
// promises).
bool anyTails(double a, double b, double x, double y, double* lower, double* upper);

}  // namespace betaratio
}  // namespace qel

#endif
