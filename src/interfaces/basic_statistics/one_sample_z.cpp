// One-sample z interval and test: the mean with the standard error
// sigma / sqrt(n) of a known sigma, against the standard normal law.
#include <cmath>
#include <limits>

#include "interfaces/basic_statistics/interval.h"
#include "interfaces/basic_statistics/utilities.h"

namespace qel {
namespace v0 {

namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

int intervalFromSummary(OneSampleZ* record, double sigma, double confidence, IntervalType type) {
  // A known sigma cannot be negative (0 gives an infinite statistic).
  if (!(sigma >= 0.0 && std::isfinite(sigma))) {
    record->standardError = record->lowerLimit = record->upperLimit = kNaN;
    record->statistic = record->pValue = kNaN;
    return qelFailBadEnumValue;
  }
  record->standardError = sigma / std::sqrt(static_cast<double>(record->n));
  return v1::MakeTraditionalSymmetricCI(NormalInvCdfFunc(), confidence, type, record->mean,
                                        record->standardError, &record->lowerLimit,
                                        &record->upperLimit);
}

int testFromSummary(OneSampleZ* record, double sigma, double confidence, IntervalType type,
                    AlternativeHypothesis alternative, double mu0) {
  const int code = intervalFromSummary(record, sigma, confidence, type);
  if (code != qelOk) return code;
  record->statistic = (record->mean - mu0) / record->standardError;
  record->pValue = NormalPValue(record->statistic, alternative);
  return qelOk;
}

}  // namespace

OneSampleZ::OneSampleZ()
    : mean(std::numeric_limits<double>::quiet_NaN()),
      standardDeviation(mean),
      standardError(mean),
      lowerLimit(mean),
      upperLimit(mean),
      statistic(mean),
      pValue(mean),
      n(0) {}

// The data forms record the sample deviation for the host's display; the
// interval itself rests on sigma alone.
int RunOneSampleZ(OneSampleZ* record, double const* x, double sigma, double confidence,
                  IntervalType type) {
  v1::CalculateMeanAndStdDev(x, record->n, &record->mean, &record->standardDeviation);
  return intervalFromSummary(record, sigma, confidence, type);
}

int RunOneSampleZ(OneSampleZ* record, double const* x, double sigma, double confidence,
                  IntervalType type, AlternativeHypothesis alternative, double mu0) {
  v1::CalculateMeanAndStdDev(x, record->n, &record->mean, &record->standardDeviation);
  return testFromSummary(record, sigma, confidence, type, alternative, mu0);
}

int RunOneSampleZ(OneSampleZ* record, double sigma, double confidence, IntervalType type) {
  return intervalFromSummary(record, sigma, confidence, type);
}

int RunOneSampleZ(OneSampleZ* record, double sigma, double confidence, IntervalType type,
                  AlternativeHypothesis alternative, double mu0) {
  return testFromSummary(record, sigma, confidence, type, alternative, mu0);
}

}  // namespace v0
}  // namespace qel
