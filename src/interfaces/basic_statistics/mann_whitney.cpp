// Mann-Whitney (Wilcoxon rank-sum) test with the Hodges-Lehmann (1963)
// estimate of the shift and its interval (Lehmann 1975, ch. 2): the k-th and
// (N-k)-th smallest of the N = n1*n2 pairwise differences. The differences
// are never formed: they are the cells of a matrix sorted along rows and
// columns, searched by the selection of Johnson and Mizoguchi (1978).
#include <qel/descriptive.h>
#include <qel/distributions.h>
#include <qel/rank_tests.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <new>
#include <vector>

#include "basic_statistics/NonparametricUtil.h"

namespace qel {
namespace v0 {

namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr double kInf = std::numeric_limits<double>::infinity();

// One sample in the compressed form of the selection: ascending order and
// cumulative frequencies 1..n (every observation its own value).
struct SortedSample {
  double const* data;
  int n;
  std::vector<int> index;
  std::vector<int> cumulative;
};

void sortSample(SortedSample& s) {
  std::vector<unsigned int> order(static_cast<std::size_t>(s.n));
  v1::GetOrder(s.data, static_cast<unsigned int>(s.n), order.data());
  s.index.assign(order.begin(), order.end());
  s.cumulative.resize(order.size());
  for (int i = 0; i < s.n; ++i) s.cumulative[i] = i + 1;
}

double at(SortedSample const& s, int position) {
  return s.data[s.index[static_cast<std::size_t>(position)]];
}

// A sample whose neighbouring gaps, walked in order, never exceed the
// tolerance (accumulated along the walk) holds one value only.
bool isIdenticalData(SortedSample const& s, double tolerance) {
  double reach = at(s, 0) + tolerance;
  for (int i = 1; i < s.n; ++i) {
    if (at(s, i) > reach) return false;
    reach = at(s, i) + tolerance;
  }
  return true;
}

double median(SortedSample const& s) {
  int high = mLowerBound((s.n + 2) / 2, s.cumulative);
  int low = mLowerBound((s.n + 1) / 2, s.cumulative);
  return 0.5 * (at(s, high) + at(s, low));
}

// Finder of successive ranks of the differences y - x. Ranks asked in
// ascending order resume from the cells eliminated by the previous search; a
// lower rank restarts the search.
class DifferenceFinder {
 public:
  DifferenceFinder(SortedSample const& x, SortedSample const& y, double tolerance)
      : x_(x), y_(y), tolerance_(tolerance) {
    mResetBoundsDiff(x.n, y.n, bounds_);
  }

  double find(double rank) {
    if (rank - eliminated_ < 1.0) {
      mResetBoundsDiff(x_.n, y_.n, bounds_);
      eliminated_ = 0.0;
    }
    double value = mFinderDiff(x_.index, x_.data, x_.cumulative, y_.index, y_.data, y_.cumulative,
                               bounds_, tolerance_, startPivot(rank), rank - eliminated_);
    eliminated_ = mGetEliminatedDiff(x_.cumulative, y_.cumulative, bounds_);
    return value;
  }

 private:
  // A first guess near the cell of that rank: the cells below rank r fill
  // roughly a corner of the sorted matrix, entered at the row (1 - u) n1 and
  // the column u n2, with u solving the corner's area for r.
  double startPivot(double rank) const {
    double total = static_cast<double>(x_.n) * y_.n;
    double half = 0.5 / y_.n;
    double u = std::sqrt(rank / total + half * half) - half;
    int row = std::clamp(static_cast<int>(std::floor((1.0 - u) * x_.n)), 0, x_.n - 1);
    int column = std::clamp(static_cast<int>(std::ceil(y_.n * u)) - 1, 0, y_.n - 1);
    return at(y_, mLowerBound(column + 1, y_.cumulative)) -
           at(x_, mLowerBound(row + 1, x_.cumulative));
  }

  SortedSample const& x_;
  SortedSample const& y_;
  double tolerance_;
  CmSelectionBounds bounds_;
  double eliminated_ = 0.0;
};

void interval(MannWhitney* record, SortedSample const& x, SortedSample const& y, double tolerance,
              double confidence, IntervalType type) {
  const double total = static_cast<double>(x.n) * y.n;
  const double sd = std::sqrt((x.n + y.n + 1) * total / 12.0);
  double alpha = 1.0 - confidence;
  if (type == kIntervalTwoSided) alpha *= 0.5;
  double k = std::floor(total / 2.0 - 0.5 + NormalInvCdf(alpha, 0.0, 1.0) * sd);
  if (!(k >= 0.0)) k = 0.0;
  const double p = NormalCdf((k + 0.5 - total / 2.0) / sd, 0.0, 1.0, false);
  record->achievedConfidence = type == kIntervalTwoSided ? 1.0 - 2.0 * p : 1.0 - p;

  DifferenceFinder finder(x, y, tolerance);
  // The matrix holds y - x; the record reports x - y, so limits swap sides.
  if (type != kIntervalLowerBound) record->upperLimit = -finder.find(k + 1.0);
  if (type == kIntervalUpperBound) record->lowerLimit = -kInf;
  const double middle = std::floor((total + 1.0) / 2.0);
  double estimate = finder.find(middle);
  if (std::fmod(total, 2.0) == 0.0) estimate = 0.5 * (estimate + finder.find(middle + 1.0));
  record->estimate = -estimate;
  if (type != kIntervalUpperBound) record->lowerLimit = -finder.find(total - k);
  if (type == kIntervalLowerBound) record->upperLimit = kInf;
}

// Sum of m (m^2 - 1) over the runs of tied values of both samples merged.
double tieSum(SortedSample const& x, SortedSample const& y, double tolerance) {
  std::vector<double> first(static_cast<std::size_t>(x.n)), second(static_cast<std::size_t>(y.n));
  for (int i = 0; i < x.n; ++i) first[i] = at(x, i);
  for (int j = 0; j < y.n; ++j) second[j] = at(y, j);
  std::vector<double> all(first.size() + second.size());
  std::merge(first.begin(), first.end(), second.begin(), second.end(), all.begin());
  double sum = 0.0;
  for (std::size_t start = 0; start < all.size();) {
    std::size_t end = start + 1;
    while (end < all.size() && !(all[end] > all[start] + tolerance)) ++end;
    double m = static_cast<double>(end - start);
    sum += m * (m * m - 1.0);
    start = end;
  }
  return sum;
}

void test(MannWhitney* record, SortedSample const& x, SortedSample const& y, double tolerance,
          AlternativeHypothesis alternative) {
  CmSelectionBounds bounds;
  mResetBoundsDiff(x.n, y.n, bounds);
  CmBandWeights w = mBoundsDiff(x.index, x.data, x.cumulative, y.index, y.data, y.cumulative,
                                bounds, 0.0, tolerance);
  const double n1 = x.n;
  const double n2 = y.n;
  const double statistic = n2 * n1 + n1 * (n1 + 1.0) / 2.0 - (0.5 * w.band + w.above);
  record->statistic = statistic;
  const double size = n1 + n2;
  const double expected = n1 * (size + 1.0) * 0.5;
  double c;
  if (alternative == kAlternativeLess) {
    c = 0.5;
  } else if (alternative == kAlternativeGreater) {
    c = -0.5;
  } else if (statistic > expected) {
    c = -std::min(0.5, statistic - expected);
  } else {
    c = std::min(0.5, expected - statistic);
  }
  const double sd = std::sqrt((size + 1.0) * n1 * n2 / 12.0);
  record->pValue = NormalPValue((statistic + c - expected) / sd, alternative);
  const double ties = tieSum(x, y, tolerance);
  if (ties == 0.0) {
    record->adjustedPValue = -1.0;
    return;
  }
  const double sdTies = std::sqrt((size + 1.0 - ties / (size * (size - 1.0))) * n1 * n2 / 12.0);
  record->adjustedPValue = NormalPValue((statistic + c - expected) / sdTies, alternative);
}

int legacyRunMannWhitney(MannWhitney* record, double const* x, double const* y, double confidence,
                         IntervalType type, AlternativeHypothesis alternative) {
  if (type < -1 || type > 1 || alternative < -1 || alternative > 1) return qelFailBadEnumValue;
  // A confidence outside (0, 1) would give an inverted interval.
  if (!(confidence > 0.0 && confidence < 1.0)) return qelFailBadEnumValue;
  if (record->firstN < 1 || record->secondN < 1) return qelFailDegenerateData;
  SortedSample first{x, record->firstN, {}, {}};
  SortedSample second{y, record->secondN, {}, {}};
  sortSample(first);
  sortSample(second);
  double largest = std::max({std::fabs(at(first, 0)), std::fabs(at(first, first.n - 1)),
                             std::fabs(at(second, 0)), std::fabs(at(second, second.n - 1))});
  const double tolerance = std::max(1e-12, 1.7763568394002505e-15 * largest);
  if (isIdenticalData(first, tolerance) || isIdenticalData(second, tolerance)) {
    return qelFailDegenerateData;
  }
  record->firstMedian = median(first);
  record->secondMedian = median(second);
  interval(record, first, second, tolerance, confidence, type);
  test(record, first, second, tolerance, alternative);
  return qelOk;
}

void reset(MannWhitney* record) {
  record->firstMedian = record->secondMedian = record->estimate = kNaN;
  record->lowerLimit = record->upperLimit = record->achievedConfidence = kNaN;
  record->statistic = record->pValue = record->adjustedPValue = kNaN;
}

}  // namespace

MannWhitney::MannWhitney() : firstN(0), secondN(0) {
  reset(this);
}

int RunLynMannWhitney(MannWhitney* record, double const* x, double const* y, double confidence,
                      IntervalType type, AlternativeHypothesis alternative) {
  reset(record);
  try {
    int code = legacyRunMannWhitney(record, x, y, confidence, type, alternative);
    if (code != qelOk) reset(record);
    return code;
  } catch (std::bad_alloc const&) {
    reset(record);
    return qelFailOutOfMemory;
  }
}

}  // namespace v0
}  // namespace qel
