#include "interfaces/math/transcendental_v1.h"

#include <algorithm>
#include <cmath>
#include <limits>

#include "utilities/LYNBasicTypes.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace v1 {

double LogGamma(double x) {
  if (!(x > 0.0) || !(7.0 + x > 7.0)) return mQuietNaN();
  return XGAMMLN(x);
}

double NearestInteger(double x) {
  return x > 0.0 ? std::floor(x + 0.5) : std::ceil(x - 0.5);
}

double CopySign(double signSource, double magnitudeSource) {
  return std::copysign(magnitudeSource, signSource);
}

bool TheseAreAlmostEqual(double a, double b) {
  const double scale = std::max(std::fabs(a), std::fabs(b));
  return std::fabs(a - b) < std::max(1e-30, std::ldexp(scale, -50));
}

double LogNChooseK(unsigned n, unsigned k) {
  const double minusInfinity = -std::numeric_limits<double>::infinity();
  if (n == 0) return k == 0 ? 0.0 : minusInfinity;
  if (k > n) return minusInfinity;
  return LogGamma(n + 1.0) - LogGamma(k + 1.0) - LogGamma(static_cast<double>(n - k) + 1.0);
}

}  // namespace v1
}  // namespace qel
