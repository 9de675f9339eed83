// The k-th smallest pairwise difference y[j] - x[i] of two samples without
// forming the n1*n2 differences: rows over the ascending values of x,
// columns over those of y, so that rows ascend to the right and columns
// descend downwards, and the cells below a threshold form a staircase that
// grows row by row (Johnson and Mizoguchi 1978).
#include <algorithm>

#include "basic_statistics/NonparametricUtil.h"
#include "basic_statistics/NonparametricUtil_search.h"

namespace qel {

namespace {

long long cumulativeAt(std::vector<int> const& cumulative, int i) {
  return i < 0 ? 0 : cumulative[i];
}

class DifferenceRectangle {
 public:
  DifferenceRectangle(std::vector<int> const& indexX, double const* x,
                      std::vector<int> const& cumulativeX, std::vector<int> const& indexY,
                      double const* y, std::vector<int> const& cumulativeY)
      : rowValues_(indexX.size()),
        columnValues_(indexY.size()),
        cumulativeX_(cumulativeX),
        cumulativeY_(cumulativeY) {
    // Contiguous copies in ascending order: every round walks them all.
    for (std::size_t i = 0; i < indexX.size(); ++i) rowValues_[i] = x[indexX[i]];
    for (std::size_t j = 0; j < indexY.size(); ++j) columnValues_[j] = y[indexY[j]];
  }

  int rows() const { return static_cast<int>(rowValues_.size()); }
  int columns() const { return static_cast<int>(columnValues_.size()); }
  double rowValue(int i) const { return rowValues_[i]; }
  double columnValue(int j) const { return columnValues_[j]; }

  long long rowWeight(int row, int right, int left) const {
    return mCalculateWeightDiff(row, right, left, cumulativeX_, cumulativeY_);
  }

  double rowMedian(int row, CmSelectionBounds const& b) const {
    int column = -1;
    mCalculateWeightDiff(row, b.upper[row], b.lower[row], cumulativeX_, cumulativeY_, &column);
    return columnValue(column) - rowValue(row);
  }

  // The difference of rank target (from 1) among the row's cells in play:
  // every column of the row counts f cells.
  double rowCell(int row, CmSelectionBounds const& b, long long target) const {
    long long f = cumulativeX_[row] - cumulativeAt(cumulativeX_, row - 1);
    long long before = cumulativeAt(cumulativeY_, b.lower[row]);
    int column = mLowerBound(static_cast<int>(before + (target + f - 1) / f), cumulativeY_,
                             b.lower[row] + 1, b.upper[row]);
    return columnValue(column) - rowValue(row);
  }

  // Columns j with y[j] - x[i] below (resp. not above) a threshold form a
  // prefix of every row that grows with i: two pointers walk up.
  CmBandWeights bounds(CmSelectionBounds& b, double pivot, double tolerance) const {
    int m = rows(), columnCount = columns();
    double low = pivot - tolerance, high = pivot + tolerance;
    int belowCount = 0, notAboveCount = 0;
    CmBandWeights w;
    for (int i = 0; i < m; ++i) {
      double xi = rowValue(i);
      while (belowCount < columnCount && columnValue(belowCount) - xi < low) ++belowCount;
      while (notAboveCount < columnCount && columnValue(notAboveCount) - xi <= high) {
        ++notAboveCount;
      }
      int lowMark = search::clampColumn(belowCount - 1, b.lower[i], b.upper[i]);
      int highMark = search::clampColumn(notAboveCount - 1, lowMark, b.upper[i]);
      b.lowMark[i] = lowMark;
      b.highMark[i] = highMark;
      w.below += double(rowWeight(i, lowMark, b.lower[i]));
      w.band += double(rowWeight(i, highMark, lowMark));
      w.above += double(rowWeight(i, b.upper[i], highMark));
    }
    return w;
  }

  void gather(CmSelectionBounds const& b, std::vector<double>& differences,
              std::vector<long long>& weights) const {
    for (int i = 0; i < rows(); ++i) {
      long long f = cumulativeX_[i] - cumulativeAt(cumulativeX_, i - 1);
      for (int j = b.lower[i] + 1; j <= b.upper[i]; ++j) {
        differences.push_back(columnValue(j) - rowValue(i));
        weights.push_back(f * (cumulativeY_[j] - cumulativeAt(cumulativeY_, j - 1)));
      }
    }
  }

 private:
  std::vector<double> rowValues_;
  std::vector<double> columnValues_;
  std::vector<int> const& cumulativeX_;
  std::vector<int> const& cumulativeY_;
};

void ensureShape(int rows, int columns, CmSelectionBounds& bounds) {
  if (static_cast<int>(bounds.lower.size()) != rows ||
      static_cast<int>(bounds.upper.size()) != rows) {
    mResetBoundsDiff(rows, columns, bounds);
  }
  bounds.lowMark.resize(rows, -1);
  bounds.highMark.resize(rows, -1);
}

}  // namespace

void mResetBoundsDiff(int rows, int columns, CmSelectionBounds& bounds) {
  bounds.lower.assign(rows, -1);
  bounds.upper.assign(rows, columns - 1);
  bounds.lowMark.assign(rows, -1);
  bounds.highMark.assign(rows, -1);
}

long long mCalculateWeightDiff(int row, int right, int left, std::vector<int> const& cumulativeX,
                               std::vector<int> const& cumulativeY, int* medianColumn) {
  if (right < 0 || right <= left) {
    if (medianColumn) *medianColumn = -1;
    return 0;
  }
  long long f = cumulativeX[row] - cumulativeAt(cumulativeX, row - 1);
  long long before = cumulativeAt(cumulativeY, left);
  long long weight = f * (cumulativeY[right] - before);
  if (medianColumn) {
    // Every column of the row counts f cells: the median cell of rank
    // (weight + 1) / 2 lies in the column reaching ceil(rank / f) values.
    long long rank = (weight + 1) / 2;
    *medianColumn =
        mLowerBound(static_cast<int>(before + (rank + f - 1) / f), cumulativeY, left + 1, right);
  }
  return weight;
}

CmBandWeights mBoundsDiff(std::vector<int> const& indexX, double const* x,
                          std::vector<int> const& cumulativeX, std::vector<int> const& indexY,
                          double const* y, std::vector<int> const& cumulativeY,
                          CmSelectionBounds& bounds, double pivot, double tolerance) {
  DifferenceRectangle rectangle(indexX, x, cumulativeX, indexY, y, cumulativeY);
  ensureShape(rectangle.rows(), rectangle.columns(), bounds);
  return rectangle.bounds(bounds, pivot, tolerance);
}

double mFinderDiff(std::vector<int> const& indexX, double const* x,
                   std::vector<int> const& cumulativeX, std::vector<int> const& indexY,
                   double const* y, std::vector<int> const& cumulativeY, CmSelectionBounds& bounds,
                   double tolerance, double startPivot, double k, double* pivotOut) {
  DifferenceRectangle rectangle(indexX, x, cumulativeX, indexY, y, cumulativeY);
  ensureShape(rectangle.rows(), rectangle.columns(), bounds);
  return search::find(rectangle, bounds, tolerance, startPivot, k, pivotOut);
}

double mGetEliminatedDiff(std::vector<int> const& cumulativeX, std::vector<int> const& cumulativeY,
                          CmSelectionBounds& bounds) {
  int rows = static_cast<int>(bounds.lower.size());
  int lastColumn = static_cast<int>(cumulativeY.size()) - 1;
  double eliminated = 0.0;
  for (int i = 0; i < rows; ++i) {
    eliminated += double(mCalculateWeightDiff(i, bounds.lower[i], -1, cumulativeX, cumulativeY));
    bounds.upper[i] = lastColumn;
  }
  return eliminated;
}

}  // namespace qel
