// The k-th smallest Walsh average of a sample without forming the n(n+1)/2
// averages: the triangle of sums v[i] + v[j], j <= i, is sorted along rows
// and columns, so the cells below a threshold form a staircase that one walk
// over the rows finds (Johnson and Mizoguchi 1978; Monahan 1984, ACM TOMS
// Algorithm 616).
#include <algorithm>

#include "basic_statistics/NonparametricUtil.h"
#include "basic_statistics/NonparametricUtil_search.h"

namespace qel {

namespace {

long long frequency(std::vector<int> const& cumulative, int i) {
  return cumulative[i] - (i > 0 ? cumulative[i - 1] : 0);
}

long long cumulativeAt(std::vector<int> const& cumulative, int i) {
  return i < 0 ? 0 : cumulative[i];
}

// Walsh averages of row `row` in columns (left, right].
inline long long weightAvg(int row, int right, int left, std::vector<int> const& cumulative) {
  int r = std::min(row, right);
  if (r < 0 || r <= left) return 0;
  long long f = frequency(cumulative, row);
  long long weight;
  if (f == 1) {
    weight = cumulative[r];
  } else if (r == row) {
    // The diagonal cell pairs the f copies of one value with each other.
    weight = f * cumulativeAt(cumulative, row - 1) + f * (f + 1) / 2;
  } else {
    weight = f * cumulative[r];
  }
  if (left >= 0) weight -= f * cumulative[left];
  return weight;
}

class WalshTriangle {
 public:
  // The values are copied in ascending order once: every round walks them
  // all, and contiguous reads beat the scattered x[index[i]].
  WalshTriangle(std::vector<int> const& index, double const* x, std::vector<int> const& cumulative)
      : values_(index.size()), cumulative_(cumulative) {
    for (std::size_t i = 0; i < index.size(); ++i) values_[i] = x[index[i]];
  }

  int rows() const { return static_cast<int>(values_.size()); }
  double value(int i) const { return values_[i]; }

  long long rowWeight(int row, int right, int left) const {
    return weightAvg(row, right, left, cumulative_);
  }

  // Sum of the row's weighted median cell among the columns in play: the
  // cell holding rank (weight + 1) / 2 counted from the left bound.
  double rowMedian(int row, CmSelectionBounds const& b) const {
    int left = b.lower[row], right = std::min(row, b.upper[row]);
    return rowCell(row, b, (weightAvg(row, right, left, cumulative_) + 1) / 2);
  }

  // Sum of the cell of rank target (from 1) among the row's cells in play.
  double rowCell(int row, CmSelectionBounds const& b, long long target) const {
    int left = b.lower[row], right = std::min(row, b.upper[row]);
    long long f = frequency(cumulative_, row);
    int lastOffDiagonal = std::min(right, row - 1);
    long long offDiagonal =
        lastOffDiagonal > left
            ? f * (cumulative_[lastOffDiagonal] - cumulativeAt(cumulative_, left))
            : 0;
    int column = row;
    if (target <= offDiagonal) {
      long long count = cumulativeAt(cumulative_, left) + (target + f - 1) / f;
      column = mLowerBound(static_cast<int>(count), cumulative_, left + 1, lastOffDiagonal);
    }
    return value(row) + value(column);
  }

  // Columns j with v[i] + v[j] below (resp. not above) a threshold form a
  // prefix of every row that shrinks as i grows: two pointers walk down.
  CmBandWeights bounds(CmSelectionBounds& b, double pivot, double tolerance) const {
    int m = rows();
    double low = pivot - tolerance, high = pivot + tolerance;
    int belowCount = m, notAboveCount = m;
    CmBandWeights w;
    for (int i = 0; i < m; ++i) {
      double vi = value(i);
      while (belowCount > 0 && !(vi + value(belowCount - 1) < low)) --belowCount;
      while (notAboveCount > 0 && !(vi + value(notAboveCount - 1) <= high)) --notAboveCount;
      int lowMark = search::clampColumn(std::min(belowCount, i + 1) - 1, b.lower[i], b.upper[i]);
      int highMark = search::clampColumn(std::min(notAboveCount, i + 1) - 1, lowMark, b.upper[i]);
      b.lowMark[i] = lowMark;
      b.highMark[i] = highMark;
      w.below += double(rowWeight(i, lowMark, b.lower[i]));
      w.band += double(rowWeight(i, highMark, lowMark));
      w.above += double(rowWeight(i, b.upper[i], highMark));
    }
    return w;
  }

  void gather(CmSelectionBounds const& b, std::vector<double>& sums,
              std::vector<long long>& weights) const {
    for (int i = 0; i < rows(); ++i) {
      long long f = frequency(cumulative_, i);
      for (int j = b.lower[i] + 1; j <= b.upper[i]; ++j) {
        sums.push_back(value(i) + value(j));
        weights.push_back(j == i ? f * (f + 1) / 2 : f * frequency(cumulative_, j));
      }
    }
  }

 private:
  std::vector<double> values_;
  std::vector<int> const& cumulative_;
};

void ensureShape(int rows, CmSelectionBounds& bounds) {
  if (static_cast<int>(bounds.lower.size()) != rows ||
      static_cast<int>(bounds.upper.size()) != rows) {
    mResetBoundsAvg(rows, bounds);
  }
  bounds.lowMark.resize(rows, -1);
  bounds.highMark.resize(rows, -1);
}

}  // namespace

void mResetBoundsAvg(int rows, CmSelectionBounds& bounds) {
  bounds.lower.assign(rows, -1);
  bounds.upper.resize(rows);
  for (int i = 0; i < rows; ++i) bounds.upper[i] = i;
  bounds.lowMark.assign(rows, -1);
  bounds.highMark.assign(rows, -1);
}

long long mCalculateWeightAvg(int row, int right, int left, std::vector<int> const& cumulative) {
  return weightAvg(row, right, left, cumulative);
}

CmBandWeights mBoundsAvg(std::vector<int> const& index, double const* x,
                         std::vector<int> const& cumulative, CmSelectionBounds& bounds,
                         double pivotSum, double tolerance) {
  int rows = static_cast<int>(index.size());
  ensureShape(rows, bounds);
  return WalshTriangle(index, x, cumulative).bounds(bounds, pivotSum, tolerance);
}

double mFinderAvg(std::vector<int> const& index, double const* x,
                  std::vector<int> const& cumulative, CmSelectionBounds& bounds, double tolerance,
                  double startPivot, double k, double* pivotOut) {
  int rows = static_cast<int>(index.size());
  ensureShape(rows, bounds);
  WalshTriangle triangle(index, x, cumulative);
  double sum = search::find(triangle, bounds, tolerance, 2.0 * startPivot, k, pivotOut);
  return sum * 0.5;
}

double mGetEliminatedAvg(std::vector<int> const& cumulative, CmSelectionBounds& bounds) {
  int rows = static_cast<int>(bounds.lower.size());
  double eliminated = 0.0;
  for (int i = 0; i < rows; ++i) {
    eliminated += double(mCalculateWeightAvg(i, bounds.lower[i], -1, cumulative));
    bounds.upper[i] = i;
  }
  return eliminated;
}

}  // namespace qel
