// ln Gamma(x) for every x > 0. The Lanczos form of mLogGamma refuses x so
// small that 7 + x rounds to 7; there ln Gamma(x) = -ln x - gamma x + O(x^2)
// (Abramowitz and Stegun 6.1.33), exact to rounding below 1e-8.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_LOG_GAMMA_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_LOG_GAMMA_H

#include <cmath>

#include "utilities/LYNBasicTypes.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

inline double mLogGammaOfPositive(double x) {
  if (x < 1e-8) return -std::log(x) - mGetEulerConst() * x;
  return mLogGamma(x);
}

}  // namespace qel

#endif
