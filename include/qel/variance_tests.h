/// \file
/// Intervals and tests for one variance (chi-square and Bonett, 2006) and
/// for the ratio of two standard deviations (F, Bonett's two-sample method,
/// and a Levene-type t test on absolute deviations from the median).
///
/// Records are caller-owned: the constructor sets every double to NaN and
/// every count to 0; the caller sets the sample size(s) and calls a Run
/// function, which returns a message code. A field that a call does not
/// compute is left as it stands. The hypothesised value of one variance is a
/// variance; that of two samples is a ratio of standard deviations sigma1 /
/// sigma2, squared where a variance ratio is needed.
///
/// Return codes: 0; 30002 for an IntervalType outside -1, 0, 1 (limits NaN,
/// tests not run) or an alternative outside -1, 0, 1 (P-values left as they
/// stand); 30001 when memory runs out; 30000 when Bonett's limits of the ratio
/// cannot be found. Limits that cannot be formed (too small a sample for the
/// quantile, a constant sample) stay NaN with code 0.
#ifndef QEL_VARIANCE_TESTS_H
#define QEL_VARIANCE_TESTS_H

#include <qel/basic_types.h>
#include <qel/export.h>

namespace qel {
namespace v0 {

/// One variance: chi-square and Bonett intervals and tests.
struct OneVariance {
  /// Doubles NaN, n 0.
  QEL_API OneVariance();
  double variance;             ///< input of the summary forms
  double chiSquareLowerLimit;  ///< lower limit of the variance, chi-square method
  double chiSquareUpperLimit;  ///< upper limit of the variance, chi-square method
  double bonettLowerLimit;     ///< lower limit of the variance, Bonett's method
  double bonettUpperLimit;     ///< upper limit of the variance, Bonett's method
  double chiSquareStatistic;   ///< (n - 1) s^2 / variance0
  double chiSquarePValue;      ///< P-value of the chi-square test
  double degreesOfFreedom;     ///< n - 1
  double bonettPValue;         ///< P-value of Bonett's test
  unsigned int n;              ///< set by the caller
};

/// Two samples: intervals and tests of the ratio sigma1 / sigma2.
struct TwoVariance {
  /// Doubles NaN, counts 0.
  QEL_API TwoVariance();
  double firstVariance;                 ///< variance of the first sample
  double secondVariance;                ///< variance of the second sample
  double firstStdDevLowerLimit;         ///< chi-square limits of each deviation
  double firstStdDevUpperLimit;         ///< upper chi-square limit of the first deviation
  double secondStdDevLowerLimit;        ///< lower chi-square limit of the second deviation
  double secondStdDevUpperLimit;        ///< upper chi-square limit of the second deviation
  double bonettLowerLimit;              ///< limits of sigma1 / sigma2
  double bonettUpperLimit;              ///< upper limit of sigma1 / sigma2, Bonett
  double leveneLowerLimit;              ///< lower limit of the ratio, Levene-type method
  double leveneUpperLimit;              ///< upper limit of the ratio, Levene-type method
  double fLowerLimit;                   ///< lower limit of the ratio from the F law
  double fUpperLimit;                   ///< upper limit of the ratio from the F law
  double bonettStatistic;               ///< z^2 for equal sizes, otherwise NaN
  double bonettPValue;                  ///< P-value of Bonett's test
  double leveneStatistic;               ///< t^2
  double levenePValue;                  ///< P-value of the Levene-type test
  double leveneDegreesOfFreedom;        ///< degrees of freedom of the Levene-type t
  double fStatistic;                    ///< s1^2 / (ratio0^2 s2^2)
  double fPValue;                       ///< P-value of the F test
  double fNumeratorDegreesOfFreedom;    ///< n1 - 1
  double fDenominatorDegreesOfFreedom;  ///< n2 - 1
  unsigned int firstN;                  ///< set by the caller
  unsigned int secondN;                 ///< set by the caller
};

/// Data forms: the variance, the chi-square and Bonett intervals (and tests
/// of variance0). Summary forms: the chi-square interval (and test) from the
/// variance field.
QEL_API int RunOneVariance(OneVariance* record, double const* x, double confidence,
                           IntervalType type);
/// Both intervals and both tests of variance0 from the n values of x.
QEL_API int RunOneVariance(OneVariance* record, double const* x, double confidence,
                           IntervalType type, AlternativeHypothesis alternative, double variance0);
/// The chi-square interval from the summary field variance.
QEL_API int RunOneVariance(OneVariance* record, double confidence, IntervalType type);
/// The chi-square interval and test of variance0 from the summary field.
QEL_API int RunOneVariance(OneVariance* record, double confidence, IntervalType type,
                           AlternativeHypothesis alternative, double variance0);

/// Data form: both variances, the summary form, then Bonett's method, or
/// with useLevene the Levene-type method (Fieller's interval for the ratio
/// of mean absolute deviations from the median), whose two samples are
/// handled in parallel. Summary form: chi-square limits of each standard
/// deviation, the F interval of the ratio and the F test.
QEL_API int RunTwoVariance(TwoVariance* record, double const* x, double const* y, double confidence,
                           IntervalType type, AlternativeHypothesis alternative, double ratio0,
                           bool useLevene);
/// The summary form: from the fields firstVariance and secondVariance.
QEL_API int RunTwoVariance(TwoVariance* record, double confidence, IntervalType type,
                           AlternativeHypothesis alternative, double ratio0);

/// The z below min(n1, n2) at which Bonett's lower limit of the variance
/// ratio, r n1 (n2 - z) / (n2 (n1 - z)) exp(-z standardError), equals ratio0
/// (a variance ratio here, like ratio); NaN when there is none.
QEL_API double SolvePValueEquation(double n1, double n2, double ratio, double ratio0,
                                   double standardError);

}  // namespace v0

namespace v1 {

/// Bonett's kurtosis estimate n sum (x - m)^4 / (sum (x - mean)^2)^2, with m
/// the trimmed mean of trim 1 / (2 sqrt(n - 4)) (0 for n <= 5) and end
/// weights; variance is the sample variance. *status gets 0, or 30001.
QEL_API double CalcTrimmedKurtosis(double const* x, double variance, unsigned int n, int* status);

}  // namespace v1
}  // namespace qel

#endif
