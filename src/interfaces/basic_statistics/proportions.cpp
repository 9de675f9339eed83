#include "interfaces/basic_statistics/proportions.h"

#include <cmath>
#include <limits>

#include "interfaces/basic_statistics/interval.h"
#include "interfaces/math/random_distributions_v0.h"

namespace qel {
namespace v0 {

double RootOrNaN(double v) {
  return v >= 0.0 ? std::sqrt(v) : std::numeric_limits<double>::quiet_NaN();
}

double ZPValue(double z, AlternativeHypothesis alternative) {
  if (alternative != kAlternativeLess && alternative != kAlternativeNotEqual &&
      alternative != kAlternativeGreater)
    return std::numeric_limits<double>::quiet_NaN();
  if (std::isinf(z)) {
    if (alternative == kAlternativeLess) return z < 0.0 ? 0.0 : 1.0;
    if (alternative == kAlternativeGreater) return z > 0.0 ? 0.0 : 1.0;
  }
  return NormalPValue(z, alternative);
}

int NormalInterval(double confidence, IntervalType type, double estimate, double standardError,
                   double* lower, double* upper) {
  return v1::MakeTraditionalSymmetricCI(NormalInvCdfFunc(), confidence, type, estimate,
                                        standardError, lower, upper);
}

double TwoSidedZ(double confidence) {
  return NormalInvCdf((1.0 + confidence) * 0.5, 0.0, 1.0);
}

}  // namespace v0
}  // namespace qel
