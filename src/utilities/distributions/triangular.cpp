// Triangular distribution on [lower, upper] with its peak at mode.
//
// Products of two distances (up to 1e308 each) would overflow; every form
// below divides a distance by a larger one first, so that wide triangles
// answer as narrow ones do.
#include <cfloat>
#include <cmath>

#include "utilities/CheckedFunctions.h"
#include "utilities/distributions/kernels.h"
#include "utilities/higher_functions/double_double.h"

namespace qel {

namespace {

// (a - b) / (c - d) for a >= b, c > d. A difference below DBL_MIN is a
// denormal, which the armed state reads as zero, although the ratio may be
// of order one (x = -4.4018151276262953e-303 just above lower
// -4.401815127626904e-303); small operands are then scaled by 2^106 first.
double distanceRatio(double a, double b, double c, double d) {
  const double numerator = a - b, denominator = c - d;
  if ((numerator < DBL_MIN || denominator < DBL_MIN) &&
      std::fmax(std::fmax(std::fabs(a), std::fabs(b)), std::fmax(std::fabs(c), std::fabs(d))) <
          1e200) {
    return (a * 0x1p106 - b * 0x1p106) / (c * 0x1p106 - d * 0x1p106);
  }
  return numerator / denominator;
}

}  // namespace

double mTriangularPdf(double x, double lower, double mode, double upper) {
  if (x > upper || x < lower) return 0.0;
  if (x > mode) return 2.0 * distanceRatio(upper, x, upper, mode) / (upper - lower);
  if (x == mode) return 2.0 / (upper - lower);
  return 2.0 * distanceRatio(x, lower, mode, lower) / (upper - lower);
}

// The tail on the far side of the mode is 1 - a^2/(b c) with a, b, c the
// distances of x, the mode and the other end from the near end. It is written
// as ((b - a) c + a (c - a)) / (b c), a sum of non-negative terms, so that it
// keeps full relative accuracy where it is small.
double mTriangularCdf(double x, double lower, double mode, double upper, bool upperTail) {
  if (x <= lower) return upperTail ? 1.0 : 0.0;
  if (x >= upper) return upperTail ? 0.0 : 1.0;
  if (x <= mode) {
    const double aOverB = distanceRatio(x, lower, mode, lower);
    if (!upperTail) return distanceRatio(x, lower, upper, lower) * aOverB;
    return distanceRatio(mode, x, mode, lower) + aOverB * distanceRatio(upper, x, upper, lower);
  }
  const double aOverB = distanceRatio(upper, x, upper, mode);
  if (upperTail) return distanceRatio(upper, x, upper, lower) * aOverB;
  return distanceRatio(x, mode, upper, mode) + aOverB * distanceRatio(x, lower, upper, lower);
}

namespace {

// sqrt(q w d) with q, w and d each the exact double-double difference of two
// doubles, to about an ulp: one Newton correction of the double root on the
// double-double product. Returns false outside magnitudes 1e-90 .. 1e100:
// above, Dekker's split could overflow; below, the low parts are subnormal,
// which the armed state reads as zero.
bool rootOfProduct(DoubleDouble q, DoubleDouble w, DoubleDouble d, DoubleDouble* root) {
  for (double v : {q.hi, w.hi, d.hi}) {
    if (!(v > 1e-90 && v < 1e100)) return false;
  }
  const DoubleDouble product = ddMul(ddMul(q, w), d);
  const double s = std::sqrt(product.hi);
  const DoubleDouble square = ddTwoProduct(s, s);
  const DoubleDouble residual = ddAdd(product, DoubleDouble{-square.hi, -square.lo});
  *root = ddFastTwoSum(s, residual.hi / (2.0 * s));
  return true;
}

}  // namespace

// The quantile is an end plus or minus a root; on the far side of the mode
// the root nearly cancels the end (x = 10 - sqrt(103.5) = -0.17), so the
// root and the distances under it are carried in double-double arithmetic.
// The plain form, whose three rounded roots cost 1.3e-14 there, remains for
// operands too large for the split and for p outside [0, 1].
double mTriangularInvCdf(double p, double lower, double mode, double upper) {
  if (p == 1.0) return upper;
  const double width = upper - lower;
  const double atMode = (mode - lower) / width;
  DoubleDouble root;
  if (p >= atMode) {
    if (p <= 1.0 &&
        rootOfProduct(ddTwoSum(1.0, -p), ddTwoSum(upper, -lower), ddTwoSum(upper, -mode), &root)) {
      return (upper - root.hi) - root.lo;
    }
    // A probability outside [0, 1] meets the square root of a negative
    // number: the checked root reports it as std::invalid_argument, as a
    // trapped invalid operation would.
    return upper - mSqrt(1.0 - p, true) * mSqrt(width, true) * mSqrt(upper - mode, true);
  }
  if (p >= 0.0 &&
      rootOfProduct(DoubleDouble{p, 0.0}, ddTwoSum(upper, -lower), ddTwoSum(mode, -lower), &root)) {
    return (lower + root.hi) + root.lo;
  }
  return lower + mSqrt(p, true) * mSqrt(width, true) * mSqrt(mode - lower, true);
}

}  // namespace qel
