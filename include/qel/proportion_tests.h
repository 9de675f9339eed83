/// \file
/// Intervals and tests for one binomial proportion and for the difference of
/// two proportions.
///
/// Records are caller-owned: the constructor sets every double to NaN and
/// every count to 0; the caller sets the trials (and, for the summary forms,
/// the events) and calls a Run function, which returns a message code. A field
/// that a call does not compute is left as it stands.
///
/// Two layers share the records. The RunLyn forms: useNormal chooses the Wald
/// interval with the plain z test, or the Clopper-Pearson interval with the
/// exact binomial test; the exact interval turns into an upper bound when
/// there are no events and into a lower bound when every trial is an event.
/// The Run forms: useScore chooses the Wilson score interval with the z test,
/// or the Clopper-Pearson interval (never retyped) with the exact test. The
/// method-named functions give one method each from the summary fields alone
/// and do not write the proportion.
///
/// Return codes: 0, or 30002 for an IntervalType outside -1, 0, 1 (both
/// limits NaN, test not run) or for an alternative outside -1, 0, 1 in an
/// exact or mid-P test (P-value left as it stands); the z tests answer such
/// an alternative with a NaN P-value and code 0; and 30002 with both limits
/// NaN for a confidence outside (0, 1) or NaN, in every interval (normal
/// approximations, Wilson with and without correction, Clopper-Pearson,
/// mid-P). Nothing else is checked: n = 0 or events > trials give NaN in the
/// concerned fields and code 0. The data forms count events as the plain sum
/// of their int entries.
#ifndef QEL_PROPORTION_TESTS_H
#define QEL_PROPORTION_TESTS_H

#include <qel/basic_types.h>
#include <qel/export.h>

namespace qel {
namespace v0 {

/// One binomial proportion: its interval and test.
struct OneProportion {
  /// Doubles NaN, counts 0.
  QEL_API OneProportion();
  double proportion;    ///< events / trials
  double lowerLimit;    ///< lower limit of the interval
  double upperLimit;    ///< upper limit of the interval
  double statistic;     ///< z, where the test has one
  double pValue;        ///< P-value of the test
  unsigned int events;  ///< input of the summary forms, output of the data forms
  unsigned int trials;  ///< always set by the caller
};

/// The difference of two proportions: its interval and tests.
struct TwoProportion {
  /// Doubles NaN, counts 0.
  QEL_API TwoProportion();
  double firstProportion;   ///< firstEvents / firstTrials
  double secondProportion;  ///< secondEvents / secondTrials
  double difference;        ///< first minus second
  double lowerLimit;        ///< lower limit of the interval of the difference
  double upperLimit;        ///< upper limit of the interval of the difference
  double statistic;         ///< z
  double pValue;            ///< of the z test
  /// Fisher's exact test, written only when the hypothesised difference is
  /// exactly 0.
  double exactPValue;
  unsigned int firstEvents;   ///< input of the summary forms, output of the data forms
  unsigned int secondEvents;  ///< input of the summary forms, output of the data forms
  unsigned int firstTrials;   ///< set by the caller
  unsigned int secondTrials;  ///< set by the caller
};

/// events / trials as a double (NaN for 0 / 0).
QEL_API double GetSampleProportion(unsigned int events, unsigned int trials);

/// Interval from the data: events holds trials int entries whose sum is the
/// number of events; Wald (useNormal) or Clopper-Pearson.
QEL_API int RunLynOneProportion(OneProportion* record, int const* events, bool useNormal,
                                double confidence, IntervalType type);
/// Interval and test of p0 from the data; the z test (useNormal) or the exact
/// binomial test.
QEL_API int RunLynOneProportion(OneProportion* record, int const* events, bool useNormal,
                                double confidence, IntervalType type,
                                AlternativeHypothesis alternative, double p0);
/// Interval from the summary fields events and trials.
QEL_API int RunLynOneProportion(OneProportion* record, bool useNormal, double confidence,
                                IntervalType type);
/// Test of p0 only, from the summary fields.
QEL_API int RunLynOneProportion(OneProportion* record, bool useNormal,
                                AlternativeHypothesis alternative, double p0);
/// Interval and test of p0 from the summary fields.
QEL_API int RunLynOneProportion(OneProportion* record, bool useNormal, double confidence,
                                IntervalType type, AlternativeHypothesis alternative, double p0);

/// Interval from the data (trials int entries summed to the events): Wilson
/// score (useScore) or Clopper-Pearson.
QEL_API int RunOneProportion(OneProportion* record, int const* events, bool useScore,
                             double confidence, IntervalType type);
/// Interval and test of p0 from the data: the z test (useScore) or the exact
/// test.
QEL_API int RunOneProportion(OneProportion* record, int const* events, bool useScore,
                             double confidence, IntervalType type,
                             AlternativeHypothesis alternative, double p0);
/// Interval from the summary fields events and trials.
QEL_API int RunOneProportion(OneProportion* record, bool useScore, double confidence,
                             IntervalType type);
/// Interval and test of p0 from the summary fields.
QEL_API int RunOneProportion(OneProportion* record, bool useScore, double confidence,
                             IntervalType type, AlternativeHypothesis alternative, double p0);

/// Wilson (1927) score interval; with continuity correction the form of
/// Newcombe (1998), whose limits are not clipped to [0, 1] and whose open end
/// is an infinity.
QEL_API int RunOneProportionWilson(OneProportion* record, bool continuityCorrection,
                                   double confidence, IntervalType type);
/// Score test z = (x - n p0 + c) / sqrt(n p0 (1 - p0)); with correction c is
/// +0.5 for "less", -0.5 for "greater", and for "not equal" -0.5 when
/// |x - n p0| >= n / 2, else 0.
QEL_API int RunOneProportionWilson(OneProportion* record, bool continuityCorrection,
                                   AlternativeHypothesis alternative, double p0);

/// Clopper-Pearson (1934) interval from beta quantiles; the exact test, its
/// two-sided P-value twice the smaller tail (each tail holding x), at most 1.
QEL_API int RunOneProportionClopperPearson(OneProportion* record, double confidence,
                                           IntervalType type);
/// The exact binomial test of p0.
QEL_API int RunOneProportionClopperPearson(OneProportion* record, AlternativeHypothesis alternative,
                                           double p0);

/// Wald interval p -/+ q sqrt(p (1 - p) / n); the correction widens both
/// limits by 0.5 / n.
QEL_API int RunOneProportionWaldCI(OneProportion* record, bool continuityCorrection,
                                   double confidence, IntervalType type);
/// Agresti-Coull (1998): the Wald interval after adding 2 events and 4 trials
/// (addTwoFour), or z^2 / 2 events and z^2 trials.
QEL_API int RunOneProportionAgrestiCoullCI(OneProportion* record, bool addTwoFour,
                                           double confidence, IntervalType type);

/// Mid-P interval and test (Lancaster, 1961): the exact tails less half the
/// probability of the observed count.
QEL_API int RunOneProportionMidP(OneProportion* record, double confidence, IntervalType type);
/// The mid-P test of p0.
QEL_API int RunOneProportionMidP(OneProportion* record, AlternativeHypothesis alternative,
                                 double p0);
/// The p at which P(X >= x) - P(X = x) / 2 (lower bound) or
/// P(X <= x) - P(X = x) / 2 (upper bound) equals alpha, clamped to [0, 1]:
/// the lower bound is 0 for x = 0 and the upper bound 1 for x = n. NaN for
/// n = 0 or x > n.
QEL_API double GetLowerMidPBound(unsigned int events, unsigned int trials, double alpha);
/// The upper mid-P bound: the p at which P(X <= x) - P(X = x) / 2 equals
/// alpha; 1 for x = n.
QEL_API double GetUpperMidPBound(unsigned int events, unsigned int trials, double alpha);

/// Difference of two proportions: the unpooled Wald interval; the z test,
/// pooled only when asked for and delta0 is exactly 0 (a non-zero delta0
/// always uses the unpooled variance); Fisher's exact P-value when delta0 is
/// exactly 0.
///
/// This form reads the data: first and second hold firstTrials and
/// secondTrials int entries whose sums are the events.
QEL_API int RunLynTwoProportion(TwoProportion* record, int const* first, int const* second,
                                bool pooled, double confidence, IntervalType type,
                                AlternativeHypothesis alternative, double delta0);
/// Interval and tests from the summary fields (events and trials of each
/// sample).
QEL_API int RunLynTwoProportion(TwoProportion* record, bool pooled, double confidence,
                                IntervalType type, AlternativeHypothesis alternative,
                                double delta0);
/// Test only; the proportion fields are not written.
QEL_API int RunLynTwoProportion(TwoProportion* record, bool pooled,
                                AlternativeHypothesis alternative, double delta0);

/// Wald interval of the difference; the correction widens both limits by
/// (1/n1 + 1/n2) / 2. Only the limits are written.
QEL_API int RunTwoProportionWaldCI(TwoProportion* record, bool continuityCorrection,
                                   double confidence, IntervalType type);
/// Agresti-Caffo (2000): the Wald interval after adding one event and two
/// trials to each sample (addOneTwo), or z^2 / 4 events and z^2 / 2 trials.
QEL_API int RunTwoProportionAgrestiCaffoCI(TwoProportion* record, bool addOneTwo, double confidence,
                                           IntervalType type);

}  // namespace v0
}  // namespace qel

#endif
