// Double-precision normal tail and quantile (see normal_precise.h).
//
// Tail: P(Z > x) = erfc(x/sqrt 2)/2 = exp(-x^2/2) erfcx(x/sqrt 2)/2, with the
// scaled complement erfcx of ACM TOMS 708 (DiDonato & Morris 1992). The
// exponent is where a far tail loses its digits: x^2/2 near 700 carries a
// rounding error of 700 ulp into exp. The square is therefore carried as
// an unevaluated sum x^2 = s + e, s = fl(x^2) and e its exact rounding error
// from a fused multiply-add (the exact-product step of Dekker 1971 and of
// Cody's ANORM, ACM TOMS 715, which splits x instead), and only s goes
// through exp.
//
// Quantile: algorithm AS 241 (PPND16) of Wichura, Applied Statistics 37
// (1988) 477-484, coefficients as published; rational approximations in
// q = p - 1/2 near the centre and in r = sqrt(-ln min(p, 1-p)) in the tails.
#include "utilities/elv/normal_precise.h"

#include <cmath>

#include "utilities/higher_functions/double_double.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace elv {

namespace {

constexpr double kInvSqrt2 = 0.70710678118654752440;
// Beyond this P(Z > x) is below the smallest subnormal double.
constexpr double kTailZero = 38.6;

// c[0] + c[1] t + ... + c[7] t^7, written out: the numerator and the
// denominator then run as two independent chains.
double horner(const double* c, double t) {
  return ((((((c[7] * t + c[6]) * t + c[5]) * t + c[4]) * t + c[3]) * t + c[2]) * t + c[1]) * t +
         c[0];
}

// AS 241 coefficients, lowest power first; the denominators' leading 1 is
// written out.
const double kA[8] = {3.3871328727963666080e+00, 1.3314166789178437745e+02,
                      1.9715909503065514427e+03, 1.3731693765509461125e+04,
                      4.5921953931549871457e+04, 6.7265770927008700853e+04,
                      3.3430575583588128105e+04, 2.5090809287301226727e+03};
const double kB[8] = {1.0,
                      4.2313330701600911252e+01,
                      6.8718700749205790830e+02,
                      5.3941960214247511077e+03,
                      2.1213794301586595867e+04,
                      3.9307895800092710610e+04,
                      2.8729085735721942674e+04,
                      5.2264952788528545610e+03};
const double kC[8] = {1.42343711074968357734e+00, 4.63033784615654529590e+00,
                      5.76949722146069140550e+00, 3.64784832476320460504e+00,
                      1.27045825245236838258e+00, 2.41780725177450611770e-01,
                      2.27238449892691845833e-02, 7.74545014278341407640e-04};
const double kD[8] = {1.0,
                      2.05319162663775882187e+00,
                      1.67638483018380384940e+00,
                      6.89767334985100004550e-01,
                      1.48103976427480074590e-01,
                      1.51986665636164571966e-02,
                      5.47593808499534494600e-04,
                      1.05075007164441684324e-09};
const double kE[8] = {6.65790464350110377720e+00, 5.46378491116411436990e+00,
                      1.78482653991729133580e+00, 2.96560571828504891230e-01,
                      2.65321895265761230930e-02, 1.24266094738807843860e-03,
                      2.71155556874348757815e-05, 2.01033439929228813265e-07};
const double kF[8] = {1.0,
                      5.99832206555887937690e-01,
                      1.36929880922735805310e-01,
                      1.48753612908506148525e-02,
                      7.86869131145613259100e-04,
                      1.84631831751005468180e-05,
                      1.42151175831644588870e-07,
                      2.04426310338993978564e-15};

// P(Z > x) for x >= 8 in double-double arithmetic, so that the far tail,
// asked for its digits rather than as a probability next to 0 or 1, is
// correctly rounded but for rare ties (within 0.5 ulp at 300 points of
// [8, 38.6] against mpmath; the double formula below is 2.6 ulp off at 30).
// phi(x) = e^(-x^2/2)/sqrt(2 pi) with x^2 exact and the double-double
// exponential; the Mills ratio P(Z > x)/phi(x) = 1/(x + 1/(x + 2/(x + ...)))
// by Laplace's continued fraction, evaluated backwards from depth
// 4 + 110/x (below 1e-20 relative for x >= 8) with the tail of the fraction
// started at the root of t = x + (depth + 1)/t. The deep steps damp their
// rounding errors by k/t^2 each, so double precision suffices until the
// last three.
double normalFarUpperTail(double x) {
  const int depth = static_cast<int>(4.0 + 110.0 / x);
  double t = 0.5 * (x + std::sqrt(x * x + 4.0 * (depth + 1)));
  for (int k = depth; k > 3; --k) t = x + k / t;
  DoubleDouble denominator = {t, 0.0};
  for (int k = 3; k >= 1; --k)
    denominator = ddAdd(ddDiv({static_cast<double>(k), 0.0}, denominator), x);
  const DoubleDouble square = ddTwoProduct(x, x);
  int exponent = 0;
  const DoubleDouble density = ddMul(ddExp({-0.5 * square.hi, -0.5 * square.lo}, &exponent),
                                     DoubleDouble{0.3989422804014327, -2.49232720227773e-17});
  const DoubleDouble tail = ddDiv(density, denominator);
  return std::ldexp(tail.hi + tail.lo, exponent);
}

}  // namespace

double normalUpperTail(double x) {
  const double z = x * kInvSqrt2;
  if (z <= 0.5) return 0.5 * erfc1(0, z);
  if (x > kTailZero) return 0.0;
  if (x >= 8.0) return normalFarUpperTail(x);
  // x^2 = square + error exactly (one fused multiply-add); exp(-error/2) is
  // 1 - error/2 to double precision, since |error| <= 2^-53 x^2 < 2e-13.
  const double square = x * x;
  const double error = std::fma(x, x, -square);
  return 0.5 * std::exp(-0.5 * square) * (1.0 - 0.5 * error) * erfc1(1, z);
}

double normalQuantile(double p) {
  const double q = p - 0.5;
  if (std::fabs(q) <= 0.425) {
    const double r = 0.180625 - q * q;
    return q * horner(kA, r) / horner(kB, r);
  }
  const double small = q < 0.0 ? p : 1.0 - p;
  double r = std::sqrt(-std::log(small));
  double z;
  if (r <= 5.0) {
    r -= 1.6;
    z = horner(kC, r) / horner(kD, r);
  } else {
    r -= 5.0;
    z = horner(kE, r) / horner(kF, r);
  }
  return q < 0.0 ? -z : z;
}

}  // namespace elv
}  // namespace qel
