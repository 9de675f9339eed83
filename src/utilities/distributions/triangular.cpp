// Triangular distribution on [lower, upper] with its peak at mode.
//
// Products of two distances (up to 1e308 each) would overflow; every form
// below divides a distance by a larger one first, so that wide triangles
// answer as narrow ones do.
#include <cmath>

#include "utilities/CheckedFunctions.h"
#include "utilities/distributions/kernels.h"

namespace qel {

double mTriangularPdf(double x, double lower, double mode, double upper) {
  if (x > upper || x < lower) return 0.0;
  if (x > mode) return 2.0 * ((upper - x) / (upper - mode)) / (upper - lower);
  if (x == mode) return 2.0 / (upper - lower);
  return 2.0 * ((x - lower) / (mode - lower)) / (upper - lower);
}

// The tail on the far side of the mode is 1 - a^2/(b c) with a, b, c the
// distances of x, the mode and the other end from the near end. It is written
// as ((b - a) c + a (c - a)) / (b c), a sum of non-negative terms, so that it
// keeps full relative accuracy where it is small.
double mTriangularCdf(double x, double lower, double mode, double upper, bool upperTail) {
  if (x <= lower) return upperTail ? 1.0 : 0.0;
  if (x >= upper) return upperTail ? 0.0 : 1.0;
  const double width = upper - lower;
  if (x <= mode) {
    const double a = x - lower;
    const double b = mode - lower;
    if (!upperTail) return (a / width) * (a / b);
    return (mode - x) / b + (a / b) * ((upper - x) / width);
  }
  const double a = upper - x;
  const double b = upper - mode;
  if (upperTail) return (a / width) * (a / b);
  return (x - mode) / b + (a / b) * ((x - lower) / width);
}

double mTriangularInvCdf(double p, double lower, double mode, double upper) {
  if (p == 1.0) return upper;
  const double width = upper - lower;
  const double atMode = (mode - lower) / width;
  // A probability outside [0, 1] meets the square root of a negative number:
  // the checked root reports it as std::invalid_argument, as a trapped invalid
  // operation would.
  if (p >= atMode) {
    return upper - mSqrt(1.0 - p, true) * mSqrt(width, true) * mSqrt(upper - mode, true);
  }
  return lower + mSqrt(p, true) * mSqrt(width, true) * mSqrt(mode - lower, true);
}

}  // namespace qel
