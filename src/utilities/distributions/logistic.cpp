// Logistic and log-logistic distributions.
//
// With z = (x - location) / scale and e = exp(-z), the lower tail is
// 1 / (1 + e) and the upper tail e / (1 + e): both are ratios without
// cancellation, so each tail keeps its relative accuracy on its own.
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/standardize.h"

namespace qel {

double mLogisticPdf(double x, double location, double scale) {
  try {
    const double e = mExponential(-mStandardize(x, location, scale), true);
    if (e == 0.0) return 0.0;
    return 1.0 / (1.0 / e + 2.0 + e) / scale;
  } catch (const std::runtime_error&) {
    // exp(-z) overflowed: x lies far below the location.
    return 0.0;
  }
}

double mLogisticCdf(double x, double location, double scale, bool upperTail) {
  try {
    const double e = mExponential(-mStandardize(x, location, scale), true);
    return upperTail ? e / (1.0 + e) : 1.0 / (1.0 + e);
  } catch (const std::runtime_error&) {
    return upperTail ? 1.0 : 0.0;
  }
}

double mLogisticInvCdf(double p, double location, double scale) {
  if (mEqualWithinFuzz(p, 0.5, 0.0)) return location;
  try {
    // log((1 - p) / p). Near the centre, 1 - 2p is exact and log1p keeps the
    // small logit accurate; elsewhere the two logarithms do not cancel.
    double logit;
    if (p > 0.25 && p < 0.75) {
      logit = std::log1p((1.0 - 2.0 * p) / p);
    } else {
      logit = mLog(1.0 - p, true) - mLog(p, true);
    }
    return location - scale * logit;
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

// ln(x - threshold) from the halves, so that a distance beyond DBL_MAX
// (x = DBL_MAX, threshold = -1e300) reaches no overflow; *half is half the
// distance.
double logDistance(double x, double threshold, double* half) {
  *half = 0.5 * x - 0.5 * threshold;
  return mLog(*half, true) + 0.69314718055994530942;
}

double mLogLogisticPdf(double x, double location, double scale, double threshold) {
  if (x <= threshold) return 0.0;
  double half = 0.0;
  const double u = logDistance(x, threshold, &half);
  const double density = mLogisticPdf(u, location, scale);
  if (mIsNumericMissing(density)) return density;
  return density / half / 2.0;
}

double mLogLogisticCdf(double x, double location, double scale, double threshold, bool upperTail) {
  if (x <= threshold) return upperTail ? 1.0 : 0.0;
  double half = 0.0;
  return mLogisticCdf(logDistance(x, threshold, &half), location, scale, upperTail);
}

// A quantile beyond the double range (exp of a logit times a scale of 1e6,
// or a threshold near DBL_MAX) has no double: no answer.
double mLogLogisticInvCdf(double p, double location, double scale, double threshold) {
  const double u = mLogisticInvCdf(p, location, scale);
  if (mIsNumericMissing(u)) return u;
  try {
    return threshold + mExponential(u, true);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

}  // namespace qel
