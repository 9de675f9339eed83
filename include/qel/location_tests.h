/// \file
/// Location tests with their confidence intervals: one-sample t, one-sample z
/// (known sigma), paired t and two-sample t (pooled or Welch).
///
/// Every test has a caller-owned record. Its constructor sets every double to
/// NaN and every count to 0; the caller sets the sample size(s) and calls a
/// Run function. Each Run function exists in four forms: raw data or summary
/// values, interval only or interval and test. The summary forms read the
/// estimate and its deviation from the record instead of computing them. A
/// field that a call does not compute is left as it stands, so on a fresh
/// record NaN means "not computed".
///
/// Return codes: 0, or 30002 for an IntervalType outside -1, 0, 1 or a
/// confidence outside (0, 1) (limits NaN), or 30001 when memory runs out
/// (paired t only). The data are not checked: NaN in the data or too few
/// observations give NaN in the concerned fields and code 0.
/// The functions run outside the armed floating-point frame; each
/// distribution call enters and leaves it by itself.
#ifndef QEL_LOCATION_TESTS_H
#define QEL_LOCATION_TESTS_H

#include <qel/basic_types.h>
#include <qel/export.h>

namespace qel {
namespace v0 {

/// One-sample t on n observations.
struct OneSampleT {
  /// Doubles NaN, counts 0.
  QEL_API OneSampleT();
  double mean;               ///< input of the summary forms
  double standardDeviation;  ///< input of the summary forms
  double standardError;      ///< of the mean
  double lowerLimit;         ///< lower limit of the interval (-inf for an upper bound)
  double upperLimit;         ///< upper limit of the interval (+inf for a lower bound)
  double statistic;          ///< t
  double pValue;             ///< P-value of the test
  unsigned int n;            ///< number of observations; set by the caller
};

/// One-sample z with a known sigma. The data forms write the sample standard
/// deviation into the record although the z interval does not use it.
struct OneSampleZ {
  /// Doubles NaN, counts 0.
  QEL_API OneSampleZ();
  double mean;               ///< input of the summary forms
  double standardDeviation;  ///< sample deviation; never read
  double standardError;      ///< sigma / sqrt(n)
  double lowerLimit;         ///< lower limit of the interval (-inf for an upper bound)
  double upperLimit;         ///< upper limit of the interval (+inf for a lower bound)
  double statistic;          ///< z
  double pValue;             ///< P-value of the test
  unsigned int n;            ///< number of observations; set by the caller
};

/// Paired t on n pairs, through the differences x[i] - y[i].
struct PairedT {
  /// Doubles NaN, counts 0.
  QEL_API PairedT();
  double firstMean;                       ///< mean of x
  double secondMean;                      ///< mean of y
  double firstStandardDeviation;          ///< standard deviation of x
  double secondStandardDeviation;         ///< standard deviation of y
  double firstStandardError;              ///< standard error of the mean of x
  double secondStandardError;             ///< standard error of the mean of y
  double meanDifference;                  ///< input of the summary forms
  double standardDeviationOfDifferences;  ///< input of the summary forms
  double standardErrorOfDifferences;      ///< standard error of the mean difference
  double lowerLimit;                      ///< lower limit of the interval (-inf for an upper bound)
  double upperLimit;                      ///< upper limit of the interval (+inf for a lower bound)
  double statistic;                       ///< t
  double pValue;                          ///< P-value of the test
  unsigned int n;                         ///< number of pairs
};

/// Two-sample t. Pooled: n1 + n2 - 2 degrees of freedom. Welch: the
/// Satterthwaite degrees of freedom rounded down to a whole number.
struct TwoSampleT {
  /// Doubles NaN, counts 0.
  QEL_API TwoSampleT();
  double firstMean;                ///< input of the summary forms
  double secondMean;               ///< input of the summary forms
  double firstStandardDeviation;   ///< input of the summary forms
  double secondStandardDeviation;  ///< input of the summary forms
  double firstStandardError;       ///< standard error of the first mean
  double secondStandardError;      ///< standard error of the second mean
  double difference;               ///< first mean - second mean
  double pooledStandardDeviation;  ///< written only when pooled
  double degreesOfFreedom;         ///< pooled or Welch degrees of freedom
  double lowerLimit;               ///< lower limit of the interval (-inf for an upper bound)
  double upperLimit;               ///< upper limit of the interval (+inf for a lower bound)
  double statistic;                ///< t
  double pValue;                   ///< P-value of the test
  unsigned int firstN;             ///< size of the first sample; set by the caller
  unsigned int secondN;            ///< size of the second sample; set by the caller
};

/// \name Run functions
/// confidence is a fraction in (0, 1); type -1 gives (-inf, upper], 0 a
/// two-sided interval, 1 [lower, +inf). The alternative is passed unchanged to
/// the P-value: -1 less, 0 not equal, 1 greater than mu0 (delta0).
/// Each returns 0, 30002 or (paired t) 30001, as the file description says.
//@{

/// One-sample t interval of the mean from the n values of x.
QEL_API int RunOneSampleT(OneSampleT* record, double const* x, double confidence,
                          IntervalType type);
/// One-sample t interval and test of the mean mu0 from the n values of x.
QEL_API int RunOneSampleT(OneSampleT* record, double const* x, double confidence, IntervalType type,
                          AlternativeHypothesis alternative, double mu0);
/// One-sample t interval from the summary fields mean and standardDeviation.
QEL_API int RunOneSampleT(OneSampleT* record, double confidence, IntervalType type);
/// One-sample t interval and test of mu0 from the summary fields.
QEL_API int RunOneSampleT(OneSampleT* record, double confidence, IntervalType type,
                          AlternativeHypothesis alternative, double mu0);

/// One-sample z interval of the mean (known sigma) from the n values of x.
QEL_API int RunOneSampleZ(OneSampleZ* record, double const* x, double sigma, double confidence,
                          IntervalType type);
/// One-sample z interval and test of the mean mu0 (known sigma) from the
/// n values of x.
QEL_API int RunOneSampleZ(OneSampleZ* record, double const* x, double sigma, double confidence,
                          IntervalType type, AlternativeHypothesis alternative, double mu0);
/// One-sample z interval from the summary field mean (known sigma).
QEL_API int RunOneSampleZ(OneSampleZ* record, double sigma, double confidence, IntervalType type);
/// One-sample z interval and test of mu0 from the summary field mean.
QEL_API int RunOneSampleZ(OneSampleZ* record, double sigma, double confidence, IntervalType type,
                          AlternativeHypothesis alternative, double mu0);

/// Paired t interval of the mean difference from the n pairs (x[i], y[i]).
QEL_API int RunPairedT(PairedT* record, double const* x, double const* y, double confidence,
                       IntervalType type);
/// Paired t interval and test of the mean difference mu0 from the n pairs.
QEL_API int RunPairedT(PairedT* record, double const* x, double const* y, double confidence,
                       IntervalType type, AlternativeHypothesis alternative, double mu0);
/// Paired t interval from the summary fields meanDifference and
/// standardDeviationOfDifferences.
QEL_API int RunPairedT(PairedT* record, double confidence, IntervalType type);
/// Paired t interval and test of mu0 from the summary fields.
QEL_API int RunPairedT(PairedT* record, double confidence, IntervalType type,
                       AlternativeHypothesis alternative, double mu0);

/// Two-sample t interval of the difference of means, pooled or Welch, from
/// firstN values of x and secondN values of y.
QEL_API int RunTwoSampleT(TwoSampleT* record, double const* x, double const* y, bool pooled,
                          double confidence, IntervalType type);
/// Two-sample t interval and test of the difference delta0 from the data.
QEL_API int RunTwoSampleT(TwoSampleT* record, double const* x, double const* y, bool pooled,
                          double confidence, IntervalType type, AlternativeHypothesis alternative,
                          double delta0);
/// Two-sample t interval from the summary fields (means and standard
/// deviations).
QEL_API int RunTwoSampleT(TwoSampleT* record, bool pooled, double confidence, IntervalType type);
/// Two-sample t interval and test of delta0 from the summary fields.
QEL_API int RunTwoSampleT(TwoSampleT* record, bool pooled, double confidence, IntervalType type,
                          AlternativeHypothesis alternative, double delta0);
//@}

}  // namespace v0
}  // namespace qel

#endif
