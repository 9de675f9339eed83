/// \file
/// Distribution-free one-sample location tests: the sign test with its
/// interpolated interval of the median, the Wilcoxon signed rank test with the
/// Hodges-Lehmann estimate, and the runs test about a value.
///
/// Records are caller-owned; the caller sets n and calls a Run function.
/// Return codes: 0; 10001 when the sign interval can only offer the extreme
/// order statistics (the confidence is beyond what the sample reaches); 10002
/// when the interval has to be interpolated toward the median (both warnings
/// come with valid results); 30001 when memory runs out; 30002 for an
/// IntervalType outside -1, 0, 1 (limits NaN, test not run).
#ifndef QEL_SIGN_TESTS_H
#define QEL_SIGN_TESTS_H

#include <qel/basic_types.h>
#include <qel/export.h>

namespace qel {
namespace v0 {

/// The sign test. Three interval rows: the narrower order-statistic interval
/// (x[d], x[n-d-1]), the interpolated one, and the wider (x[d-1], x[n-d]),
/// positions counted from 1 in the sorted sample.
struct OneSampleSign {
  double median;                  ///< sample median
  double narrowerConfidence;      ///< achieved by the narrower row
  double widerConfidence;         ///< achieved by the wider row
  double narrowerLowerLimit;      ///< lower limit of the narrower row, x[d]
  double interpolatedLowerLimit;  ///< lower limit of the interpolated row
  double widerLowerLimit;         ///< lower limit of the wider row, x[d-1]
  double narrowerUpperLimit;      ///< upper limit of the narrower row, x[n-d-1]
  double interpolatedUpperLimit;  ///< upper limit of the interpolated row
  double widerUpperLimit;         ///< upper limit of the wider row, x[n-d]
  double narrowerPosition;        ///< d + 1
  double widerPosition;           ///< d
  double pValue;                  ///< P-value of the sign test of mu0
  double countBelow;              ///< observations below mu0
  double countEqual;              ///< observations equal to mu0
  double countAbove;              ///< observations above mu0
  unsigned int n;                 ///< number of observations; set by the caller
};

/// Sets every double of the record to NaN; n is kept.
QEL_API void InitializeOneSampleSign(OneSampleSign* record);

/// Binomial law throughout.
QEL_API int RunOneSampleSign(OneSampleSign* record, double const* x, double confidence,
                             IntervalType type);
/// The interval rows and the sign test of the median mu0, binomial law.
QEL_API int RunOneSampleSign(OneSampleSign* record, double const* x, double confidence,
                             IntervalType type, AlternativeHypothesis alternative, double mu0);
/// Binomial law for n <= 50, its continuity-corrected normal approximation
/// above.
QEL_API int RunLynOneSampleSign(OneSampleSign* record, double const* x, double confidence,
                                IntervalType type);
/// The interval rows and the sign test of mu0, binomial up to n = 50 and
/// normal above.
QEL_API int RunLynOneSampleSign(OneSampleSign* record, double const* x, double confidence,
                                IntervalType type, AlternativeHypothesis alternative, double mu0);

/// The Wilcoxon signed rank test. The estimate is the Hodges-Lehmann median of
/// the Walsh averages; the interval takes its ranks from the normal
/// approximation of the signed rank law. The test form replaces n by the
/// number of observations not tied with mu0; W is the signed rank sum of
/// those above mu0 (mid-ranks for ties), its P-value the continuity-corrected
/// normal approximation without a tie correction of the variance.
struct OneSampleWilcoxon {
  /// Doubles NaN, n 0.
  QEL_API OneSampleWilcoxon();
  double estimatedMedian;     ///< Hodges-Lehmann median of the Walsh averages
  double achievedConfidence;  ///< confidence the interval reaches
  double lowerLimit;          ///< lower limit of the interval
  double upperLimit;          ///< upper limit of the interval
  double W;                   ///< signed rank sum of the observations above mu0
  double pValue;              ///< continuity-corrected normal P-value of W
  int n;                      ///< number of observations; set by the caller
};

/// The Hodges-Lehmann estimate and its interval from the n values of x.
QEL_API int RunLynOneSampleWilcoxon(OneSampleWilcoxon* record, double const* x, double confidence,
                                    IntervalType type);
/// The estimate, its interval and the signed rank test of the median mu0.
QEL_API int RunLynOneSampleWilcoxon(OneSampleWilcoxon* record, double const* x, double confidence,
                                    IntervalType type, AlternativeHypothesis alternative,
                                    double mu0);

}  // namespace v0

namespace v1 {

/// The runs test about a value k: observations equal to k are skipped, the
/// others are above (strictly greater than k) or below, and a run ends where
/// the side changes.
struct RunsTest {
  /// Counts 0, doubles NaN.
  QEL_API RunsTest();
  unsigned int countBelow;    ///< observations below k
  unsigned int countAbove;    ///< observations above k
  unsigned int observedRuns;  ///< number of runs
  double expectedRuns;        ///< 2 * above * below / m + 1, m = above + below
  double pValue;              ///< two-sided P-value
};

/// Each returns 0. With nothing but values equal to k the counts are 0 and
/// the expected runs and P-value NaN; with a single side the P-value is NaN.
/// The exact two-sided P-value from the distribution of the number of runs.
QEL_API int RunRunsTest(RunsTest* record, double const* x, double k, unsigned n);
/// The two-sided P-value from the normal approximation.
QEL_API int RunLynRunsTest(RunsTest* record, double const* x, double k, unsigned n);
/// The counts and the expected runs only.
QEL_API int CreateRunsTestStatistics(RunsTest* record, double const* x, double k, unsigned n);

}  // namespace v1
}  // namespace qel

#endif
