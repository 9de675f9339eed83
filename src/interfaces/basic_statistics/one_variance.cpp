// One variance: the chi-square interval and test under normality, and
// Bonett's (2006) interval and test, which hold for non-normal data through
// a kurtosis estimate.
#include <qel/descriptive.h>
#include <qel/distributions.h>
#include <qel/variance_tests.h>

#include <cmath>
#include <limits>

#include "basic_statistics/VarianceComparisonUtil.h"
#include "interfaces/basic_statistics/utilities_variance.h"
#include "interfaces/math/transcendental_v1.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {
namespace v0 {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

int chiSquareInterval(OneVariance* r, double confidence, IntervalType type) {
  r->degreesOfFreedom = static_cast<double>(r->n) - 1.0;
  return PerformChiSquareMethod(&r->chiSquareLowerLimit, &r->chiSquareUpperLimit, r->variance,
                                r->degreesOfFreedom, confidence, type);
}

void chiSquareTest(OneVariance* r, AlternativeHypothesis alternative, double variance0) {
  r->chiSquareStatistic = r->variance * r->degreesOfFreedom / variance0;
  r->chiSquarePValue =
      r->chiSquareStatistic < std::numeric_limits<double>::infinity()
          ? ChiSqTailPValue(r->chiSquareStatistic, r->degreesOfFreedom, alternative)
          : kNaN;
}

void bonettTest(OneVariance* r, double kurtosis, AlternativeHypothesis alternative,
                double variance0) {
  if (std::isinf(kurtosis) || v1::TheseAreAlmostEqual(variance0, 0.0)) return;
  const double n = r->n;
  const double c = 3.0 / n + kurtosis - 1.0;
  const double se = c >= 0.0 ? std::sqrt(c / (n - 1.0)) : kNaN;
  const double p = mCalcBonettPValue(alternative, n, r->variance, se, variance0);
  r->bonettPValue = mIsNumericMissing(p) ? kNaN : p;
}

// Both intervals from the data; *kurtosis gets Bonett's estimate.
int dataIntervals(OneVariance* r, double const* x, double confidence, IntervalType type,
                  double* kurtosis) {
  r->variance = v1::GetSampleVariance(x, r->n);
  const int code = chiSquareInterval(r, confidence, type);
  if (code != qelOk) return code;
  *kurtosis = r->variance;
  return PerformBonettMethod(&r->bonettLowerLimit, &r->bonettUpperLimit, kurtosis, confidence, x,
                             r->n, type);
}

}  // namespace

OneVariance::OneVariance()
    : variance(kNaN),
      chiSquareLowerLimit(kNaN),
      chiSquareUpperLimit(kNaN),
      bonettLowerLimit(kNaN),
      bonettUpperLimit(kNaN),
      chiSquareStatistic(kNaN),
      chiSquarePValue(kNaN),
      degreesOfFreedom(kNaN),
      bonettPValue(kNaN),
      n(0) {}

int RunOneVariance(OneVariance* record, double const* x, double confidence, IntervalType type) {
  double kurtosis = kNaN;
  return dataIntervals(record, x, confidence, type, &kurtosis);
}

int RunOneVariance(OneVariance* record, double const* x, double confidence, IntervalType type,
                   AlternativeHypothesis alternative, double variance0) {
  double kurtosis = kNaN;
  const int code = dataIntervals(record, x, confidence, type, &kurtosis);
  if (code != qelOk) return code;
  if (!IsKnownAlternative(alternative)) return qelFailBadEnumValue;
  chiSquareTest(record, alternative, variance0);
  bonettTest(record, kurtosis, alternative, variance0);
  return qelOk;
}

int RunOneVariance(OneVariance* record, double confidence, IntervalType type) {
  return chiSquareInterval(record, confidence, type);
}

int RunOneVariance(OneVariance* record, double confidence, IntervalType type,
                   AlternativeHypothesis alternative, double variance0) {
  const int code = chiSquareInterval(record, confidence, type);
  if (code != qelOk) return code;
  if (!IsKnownAlternative(alternative)) return qelFailBadEnumValue;
  chiSquareTest(record, alternative, variance0);
  return qelOk;
}

}  // namespace v0
}  // namespace qel
