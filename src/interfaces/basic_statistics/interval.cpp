// Symmetric confidence intervals around an estimate, for every location test
// whose statistic is (estimate - hypothesised value) / standard error.
#include "interfaces/basic_statistics/interval.h"

#include <limits>

namespace qel {
namespace v1 {

template <class F>
int MakeTraditionalSymmetricCI(F const& inverseCdf, double confidence, IntervalType type,
                               double estimate, double standardError, double* lower,
                               double* upper) {
  const double infinity = std::numeric_limits<double>::infinity();
  // A confidence outside (0, 1) would turn the interval inside out.
  if (!(confidence > 0.0 && confidence < 1.0)) {
    *lower = *upper = std::numeric_limits<double>::quiet_NaN();
    return qelFailBadEnumValue;
  }
  switch (type) {
    case kIntervalTwoSided: {
      // Each tail holds half of 1 - confidence.
      const double q = inverseCdf((1.0 + confidence) * 0.5);
      *lower = estimate - standardError * q;
      *upper = estimate + standardError * q;
      return qelOk;
    }
    case kIntervalLowerBound: {
      *upper = infinity;
      const double q = inverseCdf(confidence);
      *lower = estimate - standardError * q;
      return qelOk;
    }
    case kIntervalUpperBound: {
      *lower = -infinity;
      const double q = inverseCdf(confidence);
      *upper = estimate + standardError * q;
      return qelOk;
    }
  }
  *lower = std::numeric_limits<double>::quiet_NaN();
  *upper = std::numeric_limits<double>::quiet_NaN();
  return qelFailBadEnumValue;
}

template QEL_API int MakeTraditionalSymmetricCI<v0::NormalInvCdfFunc>(v0::NormalInvCdfFunc const&,
                                                                      double, IntervalType, double,
                                                                      double, double*, double*);
template QEL_API int MakeTraditionalSymmetricCI<v0::TInvCdfFunc>(v0::TInvCdfFunc const&, double,
                                                                 IntervalType, double, double,
                                                                 double*, double*);

}  // namespace v1
}  // namespace qel
