// One-sample t interval and test (Student, 1908): the mean with its standard
// error s / sqrt(n), on n - 1 degrees of freedom.
#include <cmath>
#include <limits>

#include "interfaces/basic_statistics/interval.h"
#include "interfaces/basic_statistics/utilities.h"

namespace qel {
namespace v0 {

namespace {

// Degrees of freedom in double arithmetic: n = 0 gives -1, not a wrapped
// unsigned value.
double degreesOfFreedom(unsigned int n) {
  return static_cast<double>(n) - 1.0;
}

int intervalFromSummary(OneSampleT* record, double confidence, IntervalType type) {
  record->standardError = record->standardDeviation / std::sqrt(static_cast<double>(record->n));
  return v1::MakeTraditionalSymmetricCI(TInvCdfFunc(degreesOfFreedom(record->n)), confidence, type,
                                        record->mean, record->standardError, &record->lowerLimit,
                                        &record->upperLimit);
}

int testFromSummary(OneSampleT* record, double confidence, IntervalType type,
                    AlternativeHypothesis alternative, double mu0) {
  const int code = intervalFromSummary(record, confidence, type);
  if (code != qelOk) return code;
  record->statistic = (record->mean - mu0) / record->standardError;
  record->pValue = TPValue(record->statistic, degreesOfFreedom(record->n), alternative);
  return qelOk;
}

}  // namespace

OneSampleT::OneSampleT()
    : mean(std::numeric_limits<double>::quiet_NaN()),
      standardDeviation(mean),
      standardError(mean),
      lowerLimit(mean),
      upperLimit(mean),
      statistic(mean),
      pValue(mean),
      n(0) {}

int RunOneSampleT(OneSampleT* record, double const* x, double confidence, IntervalType type) {
  v1::CalculateMeanAndStdDev(x, record->n, &record->mean, &record->standardDeviation);
  return intervalFromSummary(record, confidence, type);
}

int RunOneSampleT(OneSampleT* record, double const* x, double confidence, IntervalType type,
                  AlternativeHypothesis alternative, double mu0) {
  v1::CalculateMeanAndStdDev(x, record->n, &record->mean, &record->standardDeviation);
  return testFromSummary(record, confidence, type, alternative, mu0);
}

int RunOneSampleT(OneSampleT* record, double confidence, IntervalType type) {
  return intervalFromSummary(record, confidence, type);
}

int RunOneSampleT(OneSampleT* record, double confidence, IntervalType type,
                  AlternativeHypothesis alternative, double mu0) {
  return testFromSummary(record, confidence, type, alternative, mu0);
}

}  // namespace v0
}  // namespace qel
