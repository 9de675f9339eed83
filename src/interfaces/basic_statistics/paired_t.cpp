// Paired t interval and test: a one-sample t on the differences x[i] - y[i]
// of n pairs, with the per-column summaries recorded beside it.
#include <cmath>
#include <limits>
#include <new>
#include <vector>

#include "interfaces/basic_statistics/interval.h"
#include "interfaces/basic_statistics/utilities.h"

namespace qel {
namespace v0 {

namespace {

double degreesOfFreedom(unsigned int n) {
  return static_cast<double>(n) - 1.0;
}

int intervalFromSummary(PairedT* record, double confidence, IntervalType type) {
  record->standardErrorOfDifferences =
      record->standardDeviationOfDifferences / std::sqrt(static_cast<double>(record->n));
  return v1::MakeTraditionalSymmetricCI(TInvCdfFunc(degreesOfFreedom(record->n)), confidence, type,
                                        record->meanDifference, record->standardErrorOfDifferences,
                                        &record->lowerLimit, &record->upperLimit);
}

int testFromSummary(PairedT* record, double confidence, IntervalType type,
                    AlternativeHypothesis alternative, double mu0) {
  const int code = intervalFromSummary(record, confidence, type);
  if (code != qelOk) return code;
  record->statistic = (record->meanDifference - mu0) / record->standardErrorOfDifferences;
  record->pValue = TPValue(record->statistic, degreesOfFreedom(record->n), alternative);
  return qelOk;
}

// Everything the data forms compute before the interval: 0 or 30001.
int summariseData(PairedT* record, double const* x, double const* y) {
  RunPairedTHelper(*record, x, y);
  return RunPairedTForDifferences(*record, x, y);
}

}  // namespace

PairedT::PairedT()
    : firstMean(std::numeric_limits<double>::quiet_NaN()),
      secondMean(firstMean),
      firstStandardDeviation(firstMean),
      secondStandardDeviation(firstMean),
      firstStandardError(firstMean),
      secondStandardError(firstMean),
      meanDifference(firstMean),
      standardDeviationOfDifferences(firstMean),
      standardErrorOfDifferences(firstMean),
      lowerLimit(firstMean),
      upperLimit(firstMean),
      statistic(firstMean),
      pValue(firstMean),
      n(0) {}

void RunPairedTHelper(PairedT& record, double const* x, double const* y) {
  const double root = std::sqrt(static_cast<double>(record.n));
  v1::CalculateMeanAndStdDev(x, record.n, &record.firstMean, &record.firstStandardDeviation);
  v1::CalculateMeanAndStdDev(y, record.n, &record.secondMean, &record.secondStandardDeviation);
  record.firstStandardError = record.firstStandardDeviation / root;
  record.secondStandardError = record.secondStandardDeviation / root;
}

int RunPairedTForDifferences(PairedT& record, double const* x, double const* y) {
  try {
    std::vector<double> d(record.n);
    for (unsigned int i = 0; i < record.n; ++i) d[i] = x[i] - y[i];
    v1::CalculateMeanAndStdDev(d.data(), record.n, &record.meanDifference,
                               &record.standardDeviationOfDifferences);
  } catch (std::bad_alloc const&) {
    return qelFailOutOfMemory;
  }
  return qelOk;
}

int RunPairedT(PairedT* record, double const* x, double const* y, double confidence,
               IntervalType type) {
  const int code = summariseData(record, x, y);
  if (code != qelOk) return code;
  return intervalFromSummary(record, confidence, type);
}

int RunPairedT(PairedT* record, double const* x, double const* y, double confidence,
               IntervalType type, AlternativeHypothesis alternative, double mu0) {
  const int code = summariseData(record, x, y);
  if (code != qelOk) return code;
  return testFromSummary(record, confidence, type, alternative, mu0);
}

int RunPairedT(PairedT* record, double confidence, IntervalType type) {
  return intervalFromSummary(record, confidence, type);
}

int RunPairedT(PairedT* record, double confidence, IntervalType type,
               AlternativeHypothesis alternative, double mu0) {
  return testFromSummary(record, confidence, type, alternative, mu0);
}

}  // namespace v0
}  // namespace qel
