// Shared rules of the discrete kernels: how a double argument becomes a
// count, and the correction of the ELV quantile routines.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_DISCRETE_RULES_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_DISCRETE_RULES_H

#include <cmath>

#include "utilities/MathUtilities.h"

namespace qel {
namespace discrete {

// A mass function takes x as the integer *k when x is one within fuzz 0.
inline bool massPoint(double x, double* k) {
  const double r = mNearestInteger(x);
  *k = r;
  return mEqualWithinFuzz(x, r, 0.0);
}

// A distribution function takes that integer, or else floor(x).
inline double cdfPoint(double x) {
  const double r = mNearestInteger(x);
  return mEqualWithinFuzz(x, r, 0.0) ? r : std::floor(x);
}

// An upper tail P(X >= x) takes that integer, or else ceil(x): the smallest
// count that is not below x.
inline double upperPoint(double x) {
  const double r = mNearestInteger(x);
  return mEqualWithinFuzz(x, r, 0.0) ? r : std::ceil(x);
}

// An ELV quantile routine reports the quantile and the fraction of the point
// probability that p reaches. A fraction at 0 (lower routine) or at 1 (upper
// routine) means that p was met by the previous count within rounding.
constexpr double kLowerFractionLimit = 1e-9;
constexpr double kUpperFractionLimit = 0.999999999;

inline double correctedQuantile(double k, double fraction, bool fromLowerRoutine) {
  const bool met =
      fromLowerRoutine ? fraction <= kLowerFractionLimit : fraction >= kUpperFractionLimit;
  return met ? k - 1.0 : k;
}

}  // namespace discrete
}  // namespace qel

#endif
