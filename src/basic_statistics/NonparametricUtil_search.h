// The pruning search shared by the Walsh-average and the pairwise-difference
// selection (Johnson and Mizoguchi 1978; Monahan 1984, ACM TOMS 616). A
// Geometry supplies the matrix: rows(), rowWeight(i, right, left),
// rowMedian(i) (the value of the row's weighted median cell in play),
// bounds(pivot, tolerance), which sets the marks and answers CmBandWeights,
// and gather(), which lists the cells in play with their weights.
#ifndef QEL_SRC_BASIC_STATISTICS_NONPARAMETRICUTIL_SEARCH_H
#define QEL_SRC_BASIC_STATISTICS_NONPARAMETRICUTIL_SEARCH_H

#include <cmath>
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

// The k-th smallest cell in play (a value of the matrix, not halved). Each
// round drops the side of the pivot's band that cannot hold rank k. On
// success the cells below the band are dropped too, so that a later search
// for a higher rank resumes from the lower bounds.
template <class Geometry>
double find(Geometry const& g, CmSelectionBounds& b, double tolerance, double startPivot, double k,
            double* pivotOut) {
  const double nan = std::numeric_limits<double>::quiet_NaN();
  double total = cellsInPlay(g, b);
  if (!(k >= 1.0 && k <= total)) return nan;
  int m = g.rows();
  bool medianChosen = !std::isfinite(startPivot);
  double pivot = startPivot;
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
    if (medianChosen) pivot = medianPivot(g, b);
    if (std::isnan(pivot)) return nan;
    CmBandWeights w = g.bounds(b, pivot, tolerance);
    double before = total;
    if (w.below >= k) {
      for (int i = 0; i < m; ++i) b.upper[i] = b.lowMark[i];
      total = w.below;
    } else if (k > w.below + w.band) {
      k -= w.below + w.band;
      for (int i = 0; i < m; ++i) b.lower[i] = b.highMark[i];
      total = w.above;
    } else {
      break;
    }
    // A median pivot always drops at least one cell; only data holding NaN
    // can break the order the search relies on.
    if (medianChosen && !(total < before)) return nan;
    medianChosen = true;
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
