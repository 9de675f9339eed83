// Two-sample t interval and test for the difference of two means: with a
// pooled variance on n1 + n2 - 2 degrees of freedom, or with separate
// variances (Welch, 1947) on Satterthwaite's (1946) approximate degrees of
// freedom, rounded down to a whole number.
#include <cmath>
#include <limits>

#include "interfaces/basic_statistics/interval.h"
#include "interfaces/basic_statistics/utilities.h"

namespace qel {
namespace v0 {

namespace {

int intervalFromSummary(TwoSampleT* record, bool pooled, double confidence, IntervalType type,
                        double* standardError) {
  *standardError = RunTwoSampleTHelper(record, pooled);
  return v1::MakeTraditionalSymmetricCI(TInvCdfFunc(record->degreesOfFreedom), confidence, type,
                                        record->difference, *standardError, &record->lowerLimit,
                                        &record->upperLimit);
}

int testFromSummary(TwoSampleT* record, bool pooled, double confidence, IntervalType type,
                    AlternativeHypothesis alternative, double delta0) {
  double standardError = 0.0;
  const int code = intervalFromSummary(record, pooled, confidence, type, &standardError);
  if (code != qelOk) return code;
  record->statistic = (record->difference - delta0) / standardError;
  record->pValue = TPValue(record->statistic, record->degreesOfFreedom, alternative);
  return qelOk;
}

}  // namespace

TwoSampleT::TwoSampleT()
    : firstMean(std::numeric_limits<double>::quiet_NaN()),
      secondMean(firstMean),
      firstStandardDeviation(firstMean),
      secondStandardDeviation(firstMean),
      firstStandardError(firstMean),
      secondStandardError(firstMean),
      difference(firstMean),
      pooledStandardDeviation(firstMean),
      degreesOfFreedom(firstMean),
      lowerLimit(firstMean),
      upperLimit(firstMean),
      statistic(firstMean),
      pValue(firstMean),
      firstN(0),
      secondN(0) {}

void RunTwoSampleTHelper(TwoSampleT* record, double const* x, double const* y) {
  v1::CalculateMeanAndStdDev(x, record->firstN, &record->firstMean,
                             &record->firstStandardDeviation);
  v1::CalculateMeanAndStdDev(y, record->secondN, &record->secondMean,
                             &record->secondStandardDeviation);
}

double RunTwoSampleTHelper(TwoSampleT* record, bool pooled) {
  const double n1 = static_cast<double>(record->firstN);
  const double n2 = static_cast<double>(record->secondN);
  const double s1 = record->firstStandardDeviation;
  const double s2 = record->secondStandardDeviation;
  record->difference = record->firstMean - record->secondMean;
  record->firstStandardError = s1 / std::sqrt(n1);
  record->secondStandardError = s2 / std::sqrt(n2);
  if (pooled) {
    // The counts are summed as integers, then 2 is taken off in double.
    const double df =
        static_cast<double>(static_cast<unsigned long>(record->firstN) + record->secondN) - 2.0;
    record->degreesOfFreedom = df;
    record->pooledStandardDeviation =
        std::sqrt((n1 - 1.0) * s1 * s1 / df + (n2 - 1.0) * s2 * s2 / df);
    return record->pooledStandardDeviation * std::sqrt(1.0 / n1 + 1.0 / n2);
  }
  const double v1 = record->firstStandardError * record->firstStandardError;
  const double v2 = record->secondStandardError * record->secondStandardError;
  // Whole degrees of freedom only: the quantile and P-value see an integer.
  record->degreesOfFreedom =
      std::floor((v1 + v2) * (v1 + v2) / (v1 * (v1 / (n1 - 1.0)) + v2 * (v2 / (n2 - 1.0))));
  return std::sqrt(v1 + v2);
}

int RunTwoSampleT(TwoSampleT* record, double const* x, double const* y, bool pooled,
                  double confidence, IntervalType type) {
  RunTwoSampleTHelper(record, x, y);
  double standardError = 0.0;
  return intervalFromSummary(record, pooled, confidence, type, &standardError);
}

int RunTwoSampleT(TwoSampleT* record, double const* x, double const* y, bool pooled,
                  double confidence, IntervalType type, AlternativeHypothesis alternative,
                  double delta0) {
  RunTwoSampleTHelper(record, x, y);
  return testFromSummary(record, pooled, confidence, type, alternative, delta0);
}

int RunTwoSampleT(TwoSampleT* record, bool pooled, double confidence, IntervalType type) {
  double standardError = 0.0;
  return intervalFromSummary(record, pooled, confidence, type, &standardError);
}

int RunTwoSampleT(TwoSampleT* record, bool pooled, double confidence, IntervalType type,
                  AlternativeHypothesis alternative, double delta0) {
  return testFromSummary(record, pooled, confidence, type, alternative, delta0);
}

}  // namespace v0
}  // namespace qel
