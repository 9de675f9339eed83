/// \file
/// Order statistics of a column: sample quantiles of the nine definitions of
/// Hyndman and Fan (1996), the median of a sorted array, trimmed means and
/// the mode.
///
/// Functions whose name ends in OnSorted, and GetTypicalMedian, take an array
/// already sorted ascending. The others copy the data and sort the copy; the
/// caller's array is never changed. No element is tested for NaN or for the
/// missing value: such data get an unspecified order. The floating-point
/// state is not switched. Message codes: 0, 30001 (out of memory), 30017
/// (unknown quantile type).
#ifndef QEL_ORDER_STATISTICS_H
#define QEL_ORDER_STATISTICS_H

#include <qel/export.h>

namespace qel {
namespace v1 {

/// quantiles[c] = the sample quantile of type 1..9 (Hyndman and Fan) at
/// probabilities[c], for c < count. p = 0 gives the minimum and p = 1 the
/// maximum for every type; p outside [0, 1] or NaN gives NaN; n = 0 gives NaN
/// everywhere. An unknown type returns 30017 and writes nothing.
QEL_API int GetSampleQuantiles(double const* x, unsigned int n, int type, double* quantiles,
                               double const* probabilities, unsigned int count);

/// Median of sorted data; NaN for n = 0.
QEL_API double GetTypicalMedian(double const* sorted, unsigned int n);

/// The library's 5% trimmed mean: floor(0.05 n + 0.5) observations dropped
/// at each end, NaN when nothing is left. *status gets 0, or 30001.
QEL_API double GetLynTrimmedMean(double const* x, unsigned int n, int* status);
/// The same 5% trimmed mean of data already sorted ascending.
QEL_API double LynTrimmedMeanOnSorted(double const* sorted, unsigned int n);

/// Trimmed mean with fractional end weights: h = n*trim observations dropped
/// at each end, the partly dropped end observations weighted 1 - frac(h).
/// NaN when 2 floor(h) >= n.
QEL_API double LynTrimmedMeanOnSorted(double const* sorted, unsigned int n, double trim);

/// Mean of whole observations after dropping floor(n*trim) at each end; NaN
/// when nothing is left. GetTrimmedMean sets *status to 0, or 30001.
QEL_API double GetTrimmedMean(double const* x, unsigned int n, double trim, int* status);
/// The same trimmed mean of data already sorted ascending.
QEL_API double TrimmedMeanOnSorted(double const* sorted, unsigned int n, double trim);

/// The most frequent values (exact equality). At most `capacity` modes are
/// stored in ascending order, later ones of the same frequency are dropped;
/// unused slots get NaN. A value seen once is never a mode: all-distinct data
/// have modeCount 0 and frequency 0. Returns 0, or 30001 (modes reset).
QEL_API int GetMode(double const* x, unsigned int n, double* modes, unsigned int capacity,
                    unsigned int* modeCount, unsigned int* frequency);
/// The same on sorted data; answers the number of modes stored.
QEL_API unsigned int ModeOnSorted(double const* sorted, unsigned int n, double* modes,
                                  unsigned int capacity, unsigned int* frequency);
/// NaN in every slot, both counts 0.
QEL_API void ResetMode(double* modes, unsigned int capacity, unsigned int* modeCount,
                       unsigned int* frequency);

}  // namespace v1
}  // namespace qel

#endif
