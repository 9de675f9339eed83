// Difference of two binomial proportions: the unpooled Wald interval, the
// pooled or unpooled z test, Fisher's exact test (through the
// hypergeometric law of the first sample's events given both margins), and
// the Agresti-Caffo (2000) interval.
#include <qel/proportion_tests.h>

#include <limits>

#include "interfaces/basic_statistics/proportions.h"
#include "interfaces/basic_statistics/utilities.h"
#include "interfaces/math/random_distributions_v1.h"

namespace qel {
namespace v0 {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

double unpooledVariance(double p1, double n1, double p2, double n2) {
  return (1.0 - p1) * p1 / n1 + (1.0 - p2) * p2 / n2;
}

int waldInterval(TwoProportion* r, double p1, double p2, double confidence, IntervalType type) {
  const double n1 = r->firstTrials, n2 = r->secondTrials;
  return NormalInterval(confidence, type, p1 - p2, RootOrNaN(unpooledVariance(p1, n1, p2, n2)),
                        &r->lowerLimit, &r->upperLimit);
}

// The z test; the pooled variance only for a zero delta0, and Fisher's exact
// P-value only then too.
int runTest(TwoProportion* r, bool pooled, AlternativeHypothesis alternative, double delta0) {
  const double n1 = r->firstTrials, n2 = r->secondTrials;
  const double p1 = GetSampleProportion(r->firstEvents, r->firstTrials);
  const double p2 = GetSampleProportion(r->secondEvents, r->secondTrials);
  double variance = unpooledVariance(p1, n1, p2, n2);
  if (pooled && delta0 == 0.0) {
    const double pbar = (static_cast<double>(r->firstEvents) + r->secondEvents) / (n1 + n2);
    variance = pbar * (1.0 - pbar) * (1.0 / n1 + 1.0 / n2);
  }
  r->statistic = (p1 - p2 - delta0) / RootOrNaN(variance);
  r->pValue = ZPValue(r->statistic, alternative);
  if (delta0 == 0.0) {
    const unsigned long total = static_cast<unsigned long>(r->firstTrials) + r->secondTrials;
    const unsigned long events = static_cast<unsigned long>(r->firstEvents) + r->secondEvents;
    // The hypergeometric law counts in unsigned int; larger tables have none.
    const unsigned long most = std::numeric_limits<unsigned int>::max();
    r->exactPValue =
        total > most || events > most
            ? kNaN
            : v1::HypergeometricPValue(r->firstEvents, static_cast<unsigned>(total), r->firstTrials,
                                       static_cast<unsigned>(events), alternative);
  }
  return qelOk;
}

int intervalAndTest(TwoProportion* r, bool pooled, double confidence, IntervalType type,
                    AlternativeHypothesis alternative, double delta0) {
  r->firstProportion = GetSampleProportion(r->firstEvents, r->firstTrials);
  r->secondProportion = GetSampleProportion(r->secondEvents, r->secondTrials);
  r->difference = r->firstProportion - r->secondProportion;
  const int code = waldInterval(r, r->firstProportion, r->secondProportion, confidence, type);
  if (code != qelOk) return code;
  return runTest(r, pooled, alternative, delta0);
}

}  // namespace

TwoProportion::TwoProportion()
    : firstProportion(kNaN),
      secondProportion(kNaN),
      difference(kNaN),
      lowerLimit(kNaN),
      upperLimit(kNaN),
      statistic(kNaN),
      pValue(kNaN),
      exactPValue(kNaN),
      firstEvents(0),
      secondEvents(0),
      firstTrials(0),
      secondTrials(0) {}

int RunLynTwoProportion(TwoProportion* record, int const* first, int const* second, bool pooled,
                        double confidence, IntervalType type, AlternativeHypothesis alternative,
                        double delta0) {
  record->firstEvents = v1::GetEventCount(first, record->firstTrials);
  record->secondEvents = v1::GetEventCount(second, record->secondTrials);
  return intervalAndTest(record, pooled, confidence, type, alternative, delta0);
}

int RunLynTwoProportion(TwoProportion* record, bool pooled, double confidence, IntervalType type,
                        AlternativeHypothesis alternative, double delta0) {
  return intervalAndTest(record, pooled, confidence, type, alternative, delta0);
}

int RunLynTwoProportion(TwoProportion* record, bool pooled, AlternativeHypothesis alternative,
                        double delta0) {
  return runTest(record, pooled, alternative, delta0);
}

int RunTwoProportionWaldCI(TwoProportion* record, bool continuityCorrection, double confidence,
                           IntervalType type) {
  const double p1 = GetSampleProportion(record->firstEvents, record->firstTrials);
  const double p2 = GetSampleProportion(record->secondEvents, record->secondTrials);
  const int code = waldInterval(record, p1, p2, confidence, type);
  if (code == qelOk && continuityCorrection) {
    const double d = 0.5 * (1.0 / record->firstTrials + 1.0 / record->secondTrials);
    record->lowerLimit -= d;
    record->upperLimit += d;
  }
  return code;
}

int RunTwoProportionAgrestiCaffoCI(TwoProportion* record, bool addOneTwo, double confidence,
                                   IntervalType type) {
  double events = 1.0, trials = 2.0;
  if (!addOneTwo) {
    const double z = TwoSidedZ(confidence);
    events = 0.25 * z * z;
    trials = 0.5 * z * z;
  }
  const double n1 = record->firstTrials + trials, n2 = record->secondTrials + trials;
  const double p1 = (record->firstEvents + events) / n1;
  const double p2 = (record->secondEvents + events) / n2;
  return NormalInterval(confidence, type, p1 - p2, RootOrNaN(unpooledVariance(p1, n1, p2, n2)),
                        &record->lowerLimit, &record->upperLimit);
}

}  // namespace v0
}  // namespace qel
