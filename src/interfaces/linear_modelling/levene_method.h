// The one-way analysis of variance of Levene's test by Householder least
// squares on the design of qel::v1::experimental::MakeDesignMatrix.
#ifndef QEL_INTERFACES_LINEAR_MODELLING_LEVENE_METHOD_H
#define QEL_INTERFACES_LINEAR_MODELLING_LEVENE_METHOD_H

namespace qel {
namespace v1 {
namespace experimental {

// design: the one-way design of N rows and groups + 1 columns; its last
// column is overwritten by y, and the whole design by the reduction. F =
// (SSR/(rank-1))/(SSE/(N-rank)), SSR the fitted sum of squares without the
// intercept and SSE the residual one; rank is the number of groups that
// are not empty (an empty group's column drops out, as in R's lm). The
// P-value is the upper F tail. Both NaN when F cannot be formed. Returns 0
// or 30001.
int PerformLeveneMethod(double** design, unsigned N, unsigned groups, double const* y,
                        double* statistic, double* pValue);

}  // namespace experimental
}  // namespace v1
}  // namespace qel

#endif
