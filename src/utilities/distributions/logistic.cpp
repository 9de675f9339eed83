// Logistic and log-logistic distributions.
//
// With z = (x - location) / scale and e = exp(-z), the lower tail is
// 1 / (1 + e) and the upper tail e / (1 + e): both are ratios without
// cancellation, so each tail keeps its relative accuracy on its own.
#include <cfloat>
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/standardize.h"
#include "utilities/higher_functions/double_double.h"

namespace qel {

double mLogisticPdf(double x, double location, double scale) {
  try {
    // The density is even in z: e = exp(-|z|) <= 1 cannot overflow, and
    // where e is a denormal (1 + e)^2 = 1 leaves e / scale (mExpOverScale).
    const double t = -std::fabs(mStandardize(x, location, scale));
    if (t < -700.0) return mExpOverScale(t, scale);
    const double e = mExponential(t, true);
    return e / ((1.0 + e) * (1.0 + e)) / scale;
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

namespace {

// density / (x - threshold) without an overflow of the distance (x = DBL_MAX,
// threshold = -1e300: from the halves) and without a denormal one, which the
// armed state reads as zero (from terms scaled by 2^106).
double perDistance(double density, double x, double threshold) {
  if (std::fabs(x) > DBL_MAX / 2.0 || std::fabs(threshold) > DBL_MAX / 2.0) {
    return density / (0.5 * x - 0.5 * threshold) / 2.0;
  }
  const double distance = x - threshold;
  if (distance < DBL_MIN) return density * 0x1p106 / (x * 0x1p106 - threshold * 0x1p106);
  return density / distance;
}

const DoubleDouble kLn2 = {0.69314718055994530942, 2.3190468138462996e-17};

// ln v for a normal positive v to about 1e-20 absolute: v = m 2^k with m in
// [1/2, 1), ln m by ddLog.
DoubleDouble logOf(double v) {
  int k = 0;
  const double m = std::frexp(v, &k);
  return ddAdd(ddLog(m), ddMul(kLn2, static_cast<double>(k)));
}

// e^a for a double-double -745 < a.hi < 709, rounded to a double.
double expOf(DoubleDouble a) {
  int e = 0;
  if (a.hi <= 0.0) {
    const DoubleDouble s = ddExp(a, &e);
    return std::ldexp(s.hi + s.lo, e);
  }
  const DoubleDouble r = ddDiv({1.0, 0.0}, ddExp({-a.hi, -a.lo}, &e));
  return std::ldexp(r.hi + r.lo, -e);
}

// The density e^-|z| / (scale d (1 + e^-|z|)^2), d = x - threshold and
// z = (ln d - location) / scale, as the exponential of its logarithm carried
// in double-double. Rounding ln d to a double costs |ln d| / scale units in
// the last place (9e-14 at d = 1e-300); here ln d, z and the sum stay exact
// to about 1e-20. False where the operands leave the safe range (scale
// outside [1e-3, 1e3], a location beyond 1e6, a subnormal or infinite
// half-distance, a density beyond the double range): the plain form answers.
bool logLogisticDensity(double x, double location, double scale, double threshold,
                        double* density) {
  if (!(scale >= 1e-3 && scale <= 1e3 && std::fabs(location) <= 1e6)) return false;
  const DoubleDouble half = ddTwoSum(0.5 * x, -0.5 * threshold);
  if (!(half.hi >= DBL_MIN && half.hi <= DBL_MAX)) return false;
  const DoubleDouble logD = ddAdd(ddAdd(logOf(half.hi), half.lo / half.hi), kLn2);
  const DoubleDouble z = ddDiv(ddAdd(logD, -location), {scale, 0.0});
  const DoubleDouble minusAbsZ = z.hi > 0.0 ? DoubleDouble{-z.hi, -z.lo} : z;
  const double tail = minusAbsZ.hi > -745.0 ? std::exp(minusAbsZ.hi) : 0.0;
  DoubleDouble logDensity = ddAdd(minusAbsZ, DoubleDouble{-logD.hi, -logD.lo});
  const DoubleDouble logScale = logOf(scale);
  logDensity = ddAdd(logDensity, DoubleDouble{-logScale.hi, -logScale.lo});
  logDensity = ddAdd(logDensity, -2.0 * std::log1p(tail));
  if (logDensity.hi >= 709.0) return false;
  *density = logDensity.hi <= -745.0 ? 0.0 : expOf(logDensity);
  return true;
}

}  // namespace

double mLogLogisticPdf(double x, double location, double scale, double threshold) {
  if (x <= threshold) return 0.0;
  double precise = 0.0;
  if (logLogisticDensity(x, location, scale, threshold, &precise)) return precise;
  const double u = mLogOfDifference(x, threshold);
  const double density = mLogisticPdf(u, location, scale);
  if (mIsNumericMissing(density)) return density;
  // A logistic density below DBL_MIN is a denormal, read as zero by the
  // armed state, although divided by a small distance it may be normal: the
  // density e / (scale (1 + e)^2), e = exp(t), and 1 / (x - threshold) =
  // exp(-u) join in one exponential (mExpOverScale).
  if (density < DBL_MIN) {
    const double t = -std::fabs(mStandardize(u, location, scale));
    try {
      return mExpOverScale(t - u - 2.0 * std::log1p(std::exp(t)), scale);
    } catch (const std::runtime_error&) {
      return mGetMissingValueCode();
    }
  }
  return perDistance(density, x, threshold);
}

double mLogLogisticCdf(double x, double location, double scale, double threshold, bool upperTail) {
  if (x <= threshold) return upperTail ? 1.0 : 0.0;
  return mLogisticCdf(mLogOfDifference(x, threshold), location, scale, upperTail);
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
