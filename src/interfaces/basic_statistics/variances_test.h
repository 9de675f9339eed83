// The steps of the multi-sample variances test.
#ifndef QEL_SRC_INTERFACES_BASIC_STATISTICS_VARIANCES_TEST_H
#define QEL_SRC_INTERFACES_BASIC_STATISTICS_VARIANCES_TEST_H

#include <qel/variances_test.h>

namespace qel {
namespace v0 {

// Chi-square limits of each variance at the individual confidence and the
// F (k = 2) or Bartlett test; Levene fields and work values NaN.
int RunVariancesTestNormal(VariancesTest* test);

// Bartlett's statistic and P-value: the chi-square form below 130 samples,
// Box's (1949) F form from 130.
void PerformBarlettMethod(VariancesTest* test);

// V_i of each sample (fourth work value) from the pairwise standard errors
// c_ij of the log variance ratio, after Hochberg and Tamhane (1987): V_i +
// V_j approximates c_ij. The third work values hold the kurtoses.
void CalcVMulSample(VariancesTest* test);
// The same for two samples, split in proportion to each sample's share.
void CalcVTwoSample(VariancesTest* test);

// The smallest pairwise P-value by the normal range law; main P-value.
void CalcPForMulSample(VariancesTest* test);
// Bonett's two-sided test of equal variances; main P-value. Returns z, the
// normal quantile of (1 + confidence)/2, for the comparison limits.
double PerformMCTwoSample(VariancesTest* test, double confidence);

// Levene's test on absolute deviations from the sample medians (type 6
// quantile at 0.5): 0 or 30001.
int PerformMultipleLevene(VariancesTest* test);

}  // namespace v0
}  // namespace qel

#endif
