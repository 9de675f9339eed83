/// \file
/// Equality of the variances of k samples: Bartlett's test under normality
/// (the F test for two samples), and for any continuous law a multiple
/// comparison test built on Bonett's two-sample method in the manner of
/// Hochberg and Tamhane, with Levene's test (absolute deviations from the
/// sample medians) alongside. Each sample gets simultaneous limits of its
/// variance at the individual confidence 1 - (1 - confidence)/k.
///
/// Codes: 0; 30001 when memory runs out; 30002 for a confidence outside
/// (0, 1) (nothing is computed). Fewer than two samples give NaN statistics
/// and P-values with code 0. A value that cannot be formed (a sample too
/// small, a missing quantile) is NaN and the call goes on.
#ifndef QEL_VARIANCES_TEST_H
#define QEL_VARIANCES_TEST_H

#include <qel/export.h>

namespace qel {
namespace v0 {

/// One sample of the multi-sample test. The two work values hold the
/// kurtosis estimate and the scale V_i during the general test; on return
/// they are the lower and upper multiple comparison limits of the variance
/// (NaN under normality, or when n <= z).
struct VariancesTestSample {
  QEL_API VariancesTestSample();
  double variance;         ///< output
  double lowerLimit;       ///< simultaneous lower limit of the variance
  double upperLimit;       ///< simultaneous upper limit of the variance
  double thirdWorkValue;   ///< kurtosis, then lower comparison limit
  double fourthWorkValue;  ///< V_i, then upper comparison limit
  double const* data;      ///< input
  unsigned int n;          ///< input
};

/// The test of equal variances over k caller-owned samples, with its
/// results.
struct VariancesTest {
  QEL_API VariancesTest();
  double leveneStatistic;  ///< NaN under normality
  double levenePValue;     ///< P-value of Levene's test
  double mainStatistic;    ///< Bartlett or F; NaN for the comparison test with k > 2
  double mainPValue;  ///< P-value of the main statistic (of the multiple comparison test in the
                      ///< general form)
  double individualConfidence;   ///< 1 - (1 - confidence) / k, the level of each sample's limits
  VariancesTestSample* samples;  ///< caller-owned, k of them
  unsigned int k;                ///< number of samples; set by the caller
};

/// assumeNormal: chi-square limits, F (k = 2) or Bartlett's test; otherwise
/// the general form below.
QEL_API int RunVariancesTest(VariancesTest* test, double confidence, bool assumeNormal);
/// Bonett limits, the multiple comparison test and Levene's test.
QEL_API int RunVariancesTest(VariancesTest* test, double confidence);

}  // namespace v0
}  // namespace qel

#endif
