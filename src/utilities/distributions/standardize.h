// The standardised argument (x - location) / scale of the location-scale
// kernels, formed so that it cannot trap: in the armed state an overflow of
// x - location or of the division would raise an exception that the kernel
// reads as "far below the location" and answers the wrong tail. Halving both
// terms keeps the difference finite; a quotient beyond the double range is
// the infinity of its sign, which the kernels' exponentials handle.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_STANDARDIZE_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_STANDARDIZE_H

#include <cfloat>
#include <cmath>
#include <limits>

#include "utilities/CheckedFunctions.h"

namespace qel {

// All three finite, scale not 0.
//
// The difference is formed whole wherever it cannot overflow, and halved
// only where a term exceeds DBL_MAX / 2: the armed state reads a denormal
// operand as zero, so halving an x just above DBL_MIN would make a denormal
// that the subtraction drops (x = 4e-308, sigma = 1e-298 gave z = 0 where
// it is 4e-10).
inline double mStandardize(double x, double location, double scale) {
  const double inf = std::numeric_limits<double>::infinity();
  const double size = std::fabs(scale);
  if (std::fabs(x) <= DBL_MAX / 2.0 && std::fabs(location) <= DBL_MAX / 2.0) {
    const double difference = x - location;
    // A difference below DBL_MIN is a denormal (read as zero) although the
    // quotient by a scale near DBL_MIN may be of order one: form it from
    // terms scaled by 2^106, which keeps every operand normal.
    if (std::fabs(difference) < DBL_MIN && x != location) {
      return (x * 0x1p106 - location * 0x1p106) / scale * 0x1p-106;
    }
    if (size < 1.0 && std::fabs(difference) > size * (DBL_MAX / 2.0)) {
      return (difference > 0.0) == (scale > 0.0) ? inf : -inf;
    }
    const double q = difference / scale;
    if (std::fabs(q) > DBL_MAX / 2.0) return q > 0.0 ? inf : -inf;
    return q;
  }
  const double half = 0.5 * x - 0.5 * location;
  if (size < 1.0 && std::fabs(half) > size * (DBL_MAX / 2.0)) {
    return (half > 0.0) == (scale > 0.0) ? inf : -inf;
  }
  const double q = half / scale;
  if (std::fabs(q) > DBL_MAX / 2.0) return q > 0.0 ? inf : -inf;
  return 2.0 * q;
}

// exp(t) / scale, for the densities of location-scale laws. Where exp(t) is
// below DBL_MIN it is a denormal, which the armed state reads as zero,
// although divided by a scale down to DBL_MIN it may be a normal number
// down to t = -1416 (Laplace density 0.0074 at x = -9e-304, scale 1.3e-306,
// came out 0). There the exponential is formed times 2^600 (or 2^1200) and
// the scale divides before the power of 2 goes back: exp(t + L) c with L
// = 600 ln 2 (or 1200 ln 2) rounded to a double and c = exp(600 ln 2 - L)
// rounded. t + L is exact on each branch: both terms are whole multiples of
// the sum's last place.
inline double mExpOverScale(double t, double scale) {
  constexpr double kLogDblMin = -708.3964185322641;
  // Above 700, exp(t) alone may overflow where the quotient does not: t - 64
  // is exact there, and e^64 goes back after the division.
  if (t > 700.0) return mExponential(t - 64.0, true) / scale * 6.235149080811617e27;
  if (!(t < kLogDblMin)) return mExponential(t, true) / scale;
  if (t < -1500.0) return 0.0;
  if (t >= -927.0) {
    constexpr double kShiftLog = 415.88830833596717;  // 600 ln 2
    constexpr double kShiftCorrection = 1.0000000000000184;
    return std::exp(t + kShiftLog) * kShiftCorrection / scale * 0x1p-600;
  }
  constexpr double kShiftLog = 831.7766166719343;  // 1200 ln 2
  constexpr double kShiftCorrection = 1.0000000000000366;
  return std::exp(t + kShiftLog) * kShiftCorrection / scale * 0x1p-600 * 0x1p-600;
}

// log(x - threshold) for x > threshold, both finite. A difference below
// DBL_MIN is a denormal (zero to the logarithm in the armed state): it is
// formed from terms scaled by 2^106 instead; a difference that could
// overflow is formed halved.
inline double mLogOfDifference(double x, double threshold) {
  constexpr double kLn2 = 0.69314718055994530942;
  if (std::fabs(x) > DBL_MAX / 2.0 || std::fabs(threshold) > DBL_MAX / 2.0) {
    return mLog(0.5 * x - 0.5 * threshold, true) + kLn2;
  }
  const double difference = x - threshold;
  if (difference < DBL_MIN) {
    return mLog(x * 0x1p106 - threshold * 0x1p106, true) - 106.0 * kLn2;
  }
  return mLog(difference, true);
}

}  // namespace qel

#endif
