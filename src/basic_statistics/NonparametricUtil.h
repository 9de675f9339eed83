// Selection machinery of the rank-based estimators: weighted quickselect, and
// the k-th smallest Walsh average (x[i] + x[j]) / 2, i <= j, or pairwise
// difference y[j] - x[i], found without forming the candidates.
//
// A sample enters compressed to its values in ascending order: an index
// vector (index[i] is the position in the data array of the i-th value) and
// the cumulative frequencies (cumulative[i] is the number of observations at
// or below the i-th value). Tied observations may be merged into one value
// with a frequency, or kept as neighbouring values of frequency one.
//
// The candidates are the cells of a matrix sorted along rows and columns:
// for Walsh averages the triangle of sums v[i] + v[j], j <= i, over the
// values v; for differences the rectangle w[j] - v[i], rows over the first
// sample, columns over the second. An off-diagonal cell counts f_i * f_j
// times, a diagonal Walsh cell f * (f + 1) / 2 times. Each row keeps a pair
// of column bounds: the cells (lower, upper] are still in play; -1 means
// "before the first column".
//
// The search is that of Johnson and Mizoguchi (1978) and Monahan (1984, ACM
// TOMS Algorithm 616): a pivot splits the cells in play into those below,
// within a tolerance band of, and above it; the side that cannot hold the
// k-th cell is dropped, and the next pivot is the weighted median of the
// rows' median cells, which drops at least a quarter of the cells in play
// every round. On matrices of many rows a round takes instead two pivots
// from a systematic sample of the cells in play, which bracket rank k with
// high probability (Floyd and Rivest 1975) and leave a few per mille of the
// cells; the median pivot returns after a round that did not halve them.
// Each round walks the rows once along the staircase of the sorted matrix,
// so a rank costs O(m log m) for m values, and the bounds of one search are
// reused by the next, higher rank of the same sample.
//
// Cell counts of a row are long long (a repeated value of frequency f has a
// diagonal cell of f(f+1)/2, beyond 32 bits for long columns); totals and
// ranks are doubles.
#ifndef QEL_SRC_BASIC_STATISTICS_NONPARAMETRICUTIL_H
#define QEL_SRC_BASIC_STATISTICS_NONPARAMETRICUTIL_H

#include <vector>

namespace qel {

// The middle of three values, by three compare-and-swap steps.
double mMedianOfThree(double a, double b, double c);

// Weighted selection: values[i] occurs weights[i] times (weights >= 0). For
// each rank of `ranks` (1-based, ascending) result gets the value of that
// rank in the sorted multiset, or NaN for a rank below 1 or above the total
// weight. One pass of three-way partitioning (a weighted quickselect with
// median-of-three pivots). Instantiated for R = long long and W = int or
// long long.
template <typename R, typename W>
void mSelectOrderStats(std::vector<R> const& ranks, double const* values,
                       std::vector<W> const& weights, std::vector<double>& result);

// The single-rank form of mSelectOrderStats.
template <typename R, typename W>
double mSelectOrderStat(R k, double const* values, std::vector<W> const& weights);

// Index of the value that holds the k-th order statistic: the first index in
// cumulative[max(first, 0) .. last] (last = -1: the final element) whose
// cumulative frequency is not below k; last + 1 if there is none.
int mLowerBound(int k, std::vector<int> const& cumulative, int first = 0, int last = -1);

// Column bounds of the rows of a candidate matrix, and the scratch of a
// search. lower/upper persist between searches; the rest is per round.
struct CmSelectionBounds {
  std::vector<int> lower;     // last column of the row eliminated below
  std::vector<int> upper;     // last column of the row still in play
  std::vector<int> lowMark;   // set by mBounds...: last column below the band
  std::vector<int> highMark;  // set by mBounds...: last column not above it
  std::vector<double> rowMedians;
  std::vector<long long> rowWeights;
};

// Weights (cell counts) of the cells in play below, within and above the
// tolerance band around a pivot.
struct CmBandWeights {
  double below = 0.0;
  double band = 0.0;
  double above = 0.0;
};

// --- Walsh averages -------------------------------------------------------

// Puts every cell of the triangle of `rows` values in play.
void mResetBoundsAvg(int rows, CmSelectionBounds& bounds);

// Number of Walsh averages in row `row` with columns in (left, right].
long long mCalculateWeightAvg(int row, int right, int left, std::vector<int> const& cumulative);

// Splits the cells in play around pivotSum (a sum of two values): below
// pivotSum - tolerance, within the band, above pivotSum + tolerance. Sets
// lowMark and highMark; lower and upper are not changed.
CmBandWeights mBoundsAvg(std::vector<int> const& index, double const* x,
                         std::vector<int> const& cumulative, CmSelectionBounds& bounds,
                         double pivotSum, double tolerance);

// The k-th smallest Walsh average among the cells in play (k from 1), with
// averages whose sum lies within `tolerance` of the final pivot sum counted
// as equal to it. startPivot (an average) is the first guess; a non-finite
// one is replaced by the median pivot. On return the cells below the band of
// the answer are eliminated (see mGetEliminatedAvg). NaN for k outside
// 1..cells in play; the sum found goes to *pivotOut when given.
double mFinderAvg(std::vector<int> const& index, double const* x,
                  std::vector<int> const& cumulative, CmSelectionBounds& bounds, double tolerance,
                  double startPivot, double k, double* pivotOut = nullptr);

// After a search: keeps the lower bounds, puts every cell above them back in
// play, and answers the number of cells eliminated below, all smaller than
// the answer. The next, higher rank r of the same sample is then found as
// the rank r - eliminated among the cells in play.
double mGetEliminatedAvg(std::vector<int> const& cumulative, CmSelectionBounds& bounds);

// --- Pairwise differences y[j] - x[i] --------------------------------------

// Puts every cell of the rows x columns rectangle in play.
void mResetBoundsDiff(int rows, int columns, CmSelectionBounds& bounds);

// Number of differences in row `row` with columns in (left, right]. When
// medianColumn is given it receives the column holding the row's weighted
// median cell (the cell of rank (weight + 1) / 2), or -1 for an empty row.
long long mCalculateWeightDiff(int row, int right, int left, std::vector<int> const& cumulativeX,
                               std::vector<int> const& cumulativeY, int* medianColumn = nullptr);

// As mBoundsAvg, for the differences y[indexY[j]] - x[indexX[i]].
CmBandWeights mBoundsDiff(std::vector<int> const& indexX, double const* x,
                          std::vector<int> const& cumulativeX, std::vector<int> const& indexY,
                          double const* y, std::vector<int> const& cumulativeY,
                          CmSelectionBounds& bounds, double pivot, double tolerance);

// The k-th smallest difference y - x among the cells in play, as mFinderAvg.
double mFinderDiff(std::vector<int> const& indexX, double const* x,
                   std::vector<int> const& cumulativeX, std::vector<int> const& indexY,
                   double const* y, std::vector<int> const& cumulativeY, CmSelectionBounds& bounds,
                   double tolerance, double startPivot, double k, double* pivotOut = nullptr);

// As mGetEliminatedAvg, for differences.
double mGetEliminatedDiff(std::vector<int> const& cumulativeX, std::vector<int> const& cumulativeY,
                          CmSelectionBounds& bounds);

}  // namespace qel

#endif
