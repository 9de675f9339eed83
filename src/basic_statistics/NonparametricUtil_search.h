// The pruning search shared by the Walsh-average and the pairwise-difference
// selection (Johnson and Mizoguchi 1978; Monahan 1984, ACM TOMS 616). A
// Geometry supplies the matrix: rows(), rowWeight(i, right, left),
// rowMedian(i) (the value of the row's weighted median cell in play),
// bounds(pivot, tolerance), which sets the marks and answers CmBandWeights,
// and gather(), which lists the cells in play with their weights.
#ifndef QEL_SRC_BASIC_STATISTICS_NONPARAMETRICUTIL_SEARCH_H
#define QEL_SRC_BASIC_STATISTICS_NONPARAMETRICUTIL_SEARCH_H

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <limits>
#include <vector>

#include "basic_statistics/NonparametricUtil.h"

namespace qel {
namespace search {

// Number of cells in play.
template <class Geometry>
double cellsInPlay(Geometry const& g, CmSelectionBounds const& b) {
  double total = 0.0;
  for (int i = 0; i < g.rows(); ++i) total += double(g.rowWeight(i, b.upper[i], b.lower[i]));
  return total;
}

// The weighted median of the rows' median cells, each row weighted by its
// cells in play: at least a quarter of the cells lie on either side of it.
template <class Geometry>
double medianPivot(Geometry const& g, CmSelectionBounds& b) {
  int m = g.rows();
  b.rowMedians.assign(m, 0.0);
  b.rowWeights.assign(m, 0);
  double total = 0.0;
  for (int i = 0; i < m; ++i) {
    long long w = g.rowWeight(i, b.upper[i], b.lower[i]);
    b.rowWeights[i] = w;
    total += double(w);
    if (w > 0) b.rowMedians[i] = g.rowMedian(i, b);
  }
  long long rank = static_cast<long long>(std::floor((1.0 + total) * 0.5));
  return mSelectOrderStat<long long, long long>(rank, b.rowMedians.data(), b.rowWeights);
}

// Once this few cells are left, they are listed and selected directly: the
// last rounds of pruning would each still walk every row.
inline double gatherLimit(int rows) {
  return 4.0 * rows + 64.0;
}

// Rows below this count search with median pivots only: a sample would
// hardly be smaller than the rows themselves.
constexpr int kSampledRowsMinimum = 256;

// Two pivots that probably bracket rank k among the cells in play (Floyd and
// Rivest 1975): a systematic sample of s cells, one at every total / s-th
// position of the cells in row order, is partially sorted at the sample
// ranks s k / total -+ 2 sqrt(s). The count of sampled cells below the k-th
// cell has a standard deviation of at most sqrt(s) / 2, so rank k falls
// between the pivots but for a chance of about 1e-4 on either side, while
// only some 4 / sqrt(s) of the cells lie between them. hasLow / hasHigh are
// false when the bracket reaches past the sample. False for a NaN cell: the
// order the search relies on is broken.
template <class Geometry>
bool samplePivots(Geometry const& g, CmSelectionBounds const& b, double total, double k,
                  std::vector<double>& sample, double& low, bool& hasLow, double& high,
                  bool& hasHigh) {
  const int m = g.rows();
  const std::size_t s = static_cast<std::size_t>(std::min(2.0 * m, 131072.0));
  const double step = total / double(s);
  sample.clear();
  sample.reserve(s);
  double next = 0.5 * step;  // position of the next sampled cell, from 0
  double start = 0.0;        // position of the first cell in play of the row
  for (int i = 0; i < m && sample.size() < s; ++i) {
    const double weight = double(g.rowWeight(i, b.upper[i], b.lower[i]));
    while (sample.size() < s && next < start + weight) {
      const long long target =
          std::min(static_cast<long long>(next - start) + 1, static_cast<long long>(weight));
      const double cell = g.rowCell(i, b, target);
      if (std::isnan(cell)) return false;
      sample.push_back(cell);
      next += step;
    }
    start += weight;
  }
  const double centre = double(sample.size()) * k / total;
  const double margin = 2.0 * std::sqrt(double(sample.size()));
  const double lowRank = std::floor(centre - margin);
  const double highRank = std::ceil(centre + margin);
  hasLow = lowRank >= 0.0;
  hasHigh = highRank < double(sample.size());
  auto first = sample.begin();
  if (hasLow) {
    first += static_cast<std::ptrdiff_t>(lowRank);
    std::nth_element(sample.begin(), first, sample.end());
    low = *first;
  }
  if (hasHigh) {
    auto at = sample.begin() + static_cast<std::ptrdiff_t>(highRank);
    std::nth_element(first, at, sample.end());
    high = *at;
  }
  return true;
}

// One pruning step about a pivot: the side of its band that cannot hold
// rank k is dropped (k is counted anew after a drop below). True when rank
// k lies in the band: the pivot is the answer.
template <class Geometry>
bool pruneAbout(Geometry const& g, CmSelectionBounds& b, double pivot, double tolerance, double& k,
                double& total) {
  const int m = g.rows();
  CmBandWeights w = g.bounds(b, pivot, tolerance);
  if (w.below >= k) {
    for (int i = 0; i < m; ++i) b.upper[i] = b.lowMark[i];
    total = w.below;
  } else if (k > w.below + w.band) {
    k -= w.below + w.band;
    for (int i = 0; i < m; ++i) b.lower[i] = b.highMark[i];
    total = w.above;
  } else {
    return true;
  }
  return false;
}

// The k-th smallest cell in play (a value of the matrix, not halved). Each
// round drops the side of a pivot's band that cannot hold rank k. The first
// pivot is startPivot when finite; then, on matrices of many rows, a pair of
// sampled pivots bracketing rank k, which drop all but a few per mille of
// the cells in a round; after a round that failed to halve the cells, and
// on small matrices throughout, the weighted median of the rows' medians,
// which drops at least a quarter. On success the cells below the band are
// dropped too, so that a later search for a higher rank resumes from the
// lower bounds.
template <class Geometry>
double find(Geometry const& g, CmSelectionBounds& b, double tolerance, double startPivot, double k,
            double* pivotOut) {
  const double nan = std::numeric_limits<double>::quiet_NaN();
  double total = cellsInPlay(g, b);
  if (!(k >= 1.0 && k <= total)) return nan;
  const int m = g.rows();
  const bool sampled = m >= kSampledRowsMinimum;
  bool useMedian = !std::isfinite(startPivot) && !sampled;
  bool first = std::isfinite(startPivot);
  double pivot = startPivot;
  std::vector<double> sample;
  for (;;) {
    if (total <= gatherLimit(m)) {
      std::vector<double> values;
      std::vector<long long> weights;
      g.gather(b, values, weights);
      pivot =
          mSelectOrderStat<long long, long long>(static_cast<long long>(k), values.data(), weights);
      if (std::isnan(pivot)) return nan;
      g.bounds(b, pivot, tolerance);
      break;
    }
    const double before = total;
    if (first || useMedian) {
      if (!first) pivot = medianPivot(g, b);
      if (std::isnan(pivot)) return nan;
      if (pruneAbout(g, b, pivot, tolerance, k, total)) break;
      // A median pivot always drops at least one cell; only data holding NaN
      // can break the order the search relies on.
      if (useMedian && !first && !(total < before)) return nan;
      first = false;
      useMedian = !sampled;
      continue;
    }
    double low = nan, high = nan;
    bool hasLow = false, hasHigh = false;
    if (!samplePivots(g, b, total, k, sample, low, hasLow, high, hasHigh)) return nan;
    const double rankBefore = k;
    if (hasLow) {
      pivot = low;
      if (pruneAbout(g, b, pivot, tolerance, k, total)) break;
    }
    // After a drop below the low pivot (k counted anew) rank k lies beyond
    // it; otherwise the bracket missed and the high pivot would drop nothing.
    if (hasHigh && (!hasLow || k < rankBefore) && total > gatherLimit(m)) {
      pivot = high;
      if (pruneAbout(g, b, pivot, tolerance, k, total)) break;
    }
    if (!(total <= 0.5 * before)) useMedian = true;
  }
  for (int i = 0; i < m; ++i) b.lower[i] = b.lowMark[i];
  if (pivotOut) *pivotOut = pivot;
  return pivot;
}

inline int clampColumn(int column, int low, int high) {
  return column < low ? low : (column > high ? high : column);
}

}  // namespace search
}  // namespace qel

#endif
