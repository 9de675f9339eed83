// Inner side of the order statistics: the nine quantile definitions on
// sorted data and the sorted copy that the interface functions work on.
#ifndef QEL_SRC_INTERFACES_BASIC_STATISTICS_ORDER_STATISTICS_H
#define QEL_SRC_INTERFACES_BASIC_STATISTICS_ORDER_STATISTICS_H

#include <qel/order_statistics.h>

#include <vector>

namespace qel {
namespace v1 {

// Sample quantiles of sorted data, one definition each (Hyndman and Fan
// 1996, types 1 to 9); see GetSampleQuantiles for the common rules.
void GetType1SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count);
void GetType2SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count);
void GetType3SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count);
void GetType4SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count);
void GetType5SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count);
void GetType6SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count);
void GetType7SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count);
void GetType8SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count);
void GetType9SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count);

// A sorted copy of x[0..n-1]; may throw std::bad_alloc.
std::vector<double> mSortedCopy(double const* x, unsigned int n);

}  // namespace v1
}  // namespace qel

#endif
