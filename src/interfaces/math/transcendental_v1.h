// Helpers of the v1 distribution layer: NaN instead of exceptions.
#ifndef QEL_SRC_INTERFACES_MATH_HIGHER_FUNCTIONS_V1_H
#define QEL_SRC_INTERFACES_MATH_HIGHER_FUNCTIONS_V1_H

namespace qel {
namespace v1 {

// ln Gamma(x) by the Lanczos form; NaN for x <= 0 and for x lost against 7.
double LogGamma(double x);
// floor(x + 0.5) for x > 0, else ceil(x - 0.5).
double NearestInteger(double x);
// The first argument's sign on the second argument's magnitude: the reverse
// of the C library's copysign, kept for the callers written against it.
double CopySign(double signSource, double magnitudeSource);
// |a - b| < max(1e-30, 2^-50 max(|a|, |b|)).
bool TheseAreAlmostEqual(double a, double b);
// ln C(n, k); minus infinity for k > n and for n = 0 < k.
double LogNChooseK(unsigned n, unsigned k);

}  // namespace v1
}  // namespace qel

#endif
