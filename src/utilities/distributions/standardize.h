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

namespace qel {

// All three finite, scale not 0.
inline double mStandardize(double x, double location, double scale) {
  const double half = 0.5 * x - 0.5 * location;
  const double inf = std::numeric_limits<double>::infinity();
  const double size = std::fabs(scale);
  if (size < 1.0 && std::fabs(half) > size * (DBL_MAX / 2.0)) {
    return (half > 0.0) == (scale > 0.0) ? inf : -inf;
  }
  const double q = half / scale;
  if (std::fabs(q) > DBL_MAX / 2.0) return q > 0.0 ? inf : -inf;
  return 2.0 * q;
}

}  // namespace qel

#endif
