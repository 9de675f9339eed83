// Cauchy distribution.
//
// The textbook forms 0.5 + atan(z)/pi and location + scale tan(pi (p - 1/2))
// lose all relative accuracy in the tails, where 0.5 cancels against
// atan(z)/pi and pi (p - 1/2) rounds to -pi/2. Beyond |z| = 1 the tail is
// computed as atan(1/|z|)/pi, and for p outside [1/4, 3/4] the quantile as
// -1/tan(pi p); both are the same functions without the cancellation.
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/standardize.h"

namespace qel {

double mCauchyPdf(double x, double location, double scale) {
  const double z = mStandardize(x, location, scale);
  const double pi = mGetPi();
  // Divided by the scale last: pi times a scale near DBL_MAX overflows.
  if (std::fabs(z) <= 1.0) return 1.0 / (pi * (1.0 + z * z)) / scale;
  // 1/(1 + z^2) = w^2/(1 + w^2) with w = 1/z: no overflow of z^2.
  // w / scale = 1 / (z scale) is at most 1 / DBL_MIN; dividing w * w by the
  // scale would make a denormal of w * w (zero in the armed state) first.
  const double w = 1.0 / z;
  return w * (w / scale) / (pi * (1.0 + w * w));
}

namespace {

// Lower tail of the standard Cauchy distribution at z.
double standardCauchyLowerTail(double z) {
  const double pi = mGetPi();
  if (z < -1.0) return std::atan(-1.0 / z) / pi;
  if (z > 1.0) return 1.0 - std::atan(1.0 / z) / pi;
  return 0.5 + std::atan(z) / pi;
}

}  // namespace

double mCauchyCdf(double x, double location, double scale, bool upperTail) {
  const double z = mStandardize(x, location, scale);
  return standardCauchyLowerTail(upperTail ? -z : z);
}

double mCauchyInvCdf(double p, double location, double scale) {
  if (p == 0.0 || p == 1.0) return mGetMissingValueCode();
  if (mEqualWithinFuzz(p, 0.5, 0.0)) return location;
  const double pi = mGetPi();
  try {
    if (p > 0.0 && p < 0.25) return location - scale / mTan(pi * p);
    if (p > 0.75 && p < 1.0) return location + scale / mTan(pi * (1.0 - p));
    return location + scale * mTan(pi * (p - 0.5));
  } catch (const std::invalid_argument&) {
    return mGetMissingValueCode();
  } catch (const std::runtime_error&) {
    // A quantile beyond the double range (a huge scale): no answer.
    return mGetMissingValueCode();
  }
}

}  // namespace qel
