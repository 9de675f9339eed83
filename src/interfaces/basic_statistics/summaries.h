// Inner side of the summaries: the interpolated sign-test interval of the
// median used by the boxplot helper.
#ifndef QEL_SRC_INTERFACES_BASIC_STATISTICS_SUMMARIES_H
#define QEL_SRC_INTERFACES_BASIC_STATISTICS_SUMMARIES_H

namespace qel {
namespace v1 {

// Two-sided confidence interval of the median of sorted[0..n-1] from the
// order statistics of depth d and d+1, interpolated after Hettmansperger and
// Sheather (1986). ExactTwoSidedCI takes d and the coverages from the
// Binomial(n, 1/2) law, ApproximateTwoSidedCI from its normal approximation
// with continuity correction. NaN limits when no order statistic reaches the
// confidence (d = 0) or n = 0.
void ExactTwoSidedCI(double* lower, double* upper, double confidence, double const* sorted,
                     unsigned int n);
void ApproximateTwoSidedCI(double* lower, double* upper, double confidence, double const* sorted,
                           unsigned int n);

}  // namespace v1
}  // namespace qel

#endif
