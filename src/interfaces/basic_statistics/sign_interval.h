// Sign interval of a median with the nonlinear interpolation of
// Hettmansperger and Sheather (1986).
#ifndef QEL_SRC_INTERFACES_BASIC_STATISTICS_SIGN_INTERVAL_H
#define QEL_SRC_INTERFACES_BASIC_STATISTICS_SIGN_INTERVAL_H

namespace qel {
namespace v0 {

// For n sorted values, the limits interpolate between the order statistics
// d and d + 1 (1-based) from each end, with weight lambda on the inner one.
// d = 1, lambda = 0 when even the sample range does not reach the confidence.
void Sint(int n, double confidence, unsigned int* d, double* lambda);

}  // namespace v0
}  // namespace qel

#endif
