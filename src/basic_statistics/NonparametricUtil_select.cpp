// Weighted selection (three-way quickselect in the manner of Hoare's FIND,
// with Dijkstra's three-way partition), the median of three and the lower
// bound over cumulative frequencies.
#include <algorithm>
#include <limits>
#include <numeric>
#include <utility>

#include "basic_statistics/NonparametricUtil.h"

namespace qel {

double mMedianOfThree(double a, double b, double c) {
  if (b < a) std::swap(a, b);
  if (c < a) std::swap(a, c);
  if (c < b) std::swap(b, c);
  return b;
}

namespace {

// A part of the index list still to be partitioned, with the ranks (a range
// of the sorted rank list) that fall inside it and the weight below it.
template <typename R>
struct SelectTask {
  std::size_t first, last;  // index list [first, last)
  std::size_t rankFirst, rankLast;
  R base;
};

// Pivot of a round: the median of three for a rank of 2 or more, which keeps
// sorted and reversed inputs linear; for rank 1 the smallest value of
// positive weight, which is the answer itself. False if no such value.
template <typename W>
bool choosePivot(long double remainingRank, std::vector<std::size_t> const& idx, std::size_t first,
                 std::size_t last, double const* values, std::vector<W> const& weights,
                 double* pivot) {
  if (remainingRank >= 2) {
    *pivot = mMedianOfThree(values[idx[first]], values[idx[first + (last - 1 - first) / 2]],
                            values[idx[last - 1]]);
    return true;
  }
  bool found = false;
  for (std::size_t i = first; i < last; ++i) {
    if (weights[idx[i]] > 0 && (!found || values[idx[i]] < *pivot)) {
      *pivot = values[idx[i]];
      found = true;
    }
  }
  return found;
}

}  // namespace

template <typename R, typename W>
void mSelectOrderStats(std::vector<R> const& ranks, double const* values,
                       std::vector<W> const& weights, std::vector<double>& result) {
  result.assign(ranks.size(), std::numeric_limits<double>::quiet_NaN());
  // Ranks are processed in ascending order; the answers go back to the
  // caller's positions. Ranks below 1 have no answer.
  std::vector<std::size_t> rankOrder;
  rankOrder.reserve(ranks.size());
  for (std::size_t r = 0; r < ranks.size(); ++r) {
    if (ranks[r] >= 1) rankOrder.push_back(r);
  }
  std::sort(rankOrder.begin(), rankOrder.end(),
            [&ranks](std::size_t a, std::size_t b) { return ranks[a] < ranks[b]; });

  std::vector<std::size_t> idx(weights.size());
  std::iota(idx.begin(), idx.end(), std::size_t(0));
  std::vector<SelectTask<R>> pending;
  pending.push_back({0, idx.size(), 0, rankOrder.size(), R(0)});
  while (!pending.empty()) {
    SelectTask<R> task = pending.back();
    pending.pop_back();
    if (task.rankFirst == task.rankLast || task.first == task.last) continue;
    double pivot = 0.0;
    long double remaining = static_cast<long double>(ranks[rankOrder[task.rankFirst]]) - task.base;
    if (!choosePivot(remaining, idx, task.first, task.last, values, weights, &pivot)) continue;

    // [first, lo) below the pivot, [lo, hi) equal (and incomparable), [hi,
    // last) above.
    std::size_t lo = task.first, i = task.first, hi = task.last;
    R weightBelow = 0, weightEqual = 0;
    while (i < hi) {
      double v = values[idx[i]];
      if (v < pivot) {
        weightBelow += weights[idx[i]];
        std::swap(idx[lo++], idx[i++]);
      } else if (v > pivot) {
        std::swap(idx[i], idx[--hi]);
      } else {
        weightEqual += weights[idx[i]];
        ++i;
      }
    }
    std::size_t r = task.rankFirst;
    while (r < task.rankLast && ranks[rankOrder[r]] - task.base <= weightBelow) ++r;
    std::size_t lowerRanks = r;
    while (r < task.rankLast && ranks[rankOrder[r]] - task.base <= weightBelow + weightEqual) {
      result[rankOrder[r]] = pivot;
      ++r;
    }
    if (lowerRanks > task.rankFirst) {
      pending.push_back({task.first, lo, task.rankFirst, lowerRanks, task.base});
    }
    if (r < task.rankLast) {
      pending.push_back({hi, task.last, r, task.rankLast, task.base + weightBelow + weightEqual});
    }
  }
}

template <typename R, typename W>
double mSelectOrderStat(R k, double const* values, std::vector<W> const& weights) {
  std::vector<R> ranks(1, k);
  std::vector<double> result;
  mSelectOrderStats(ranks, values, weights, result);
  return result[0];
}

template void mSelectOrderStats<long long, int>(std::vector<long long> const&, double const*,
                                                std::vector<int> const&, std::vector<double>&);
template void mSelectOrderStats<long long, long long>(std::vector<long long> const&, double const*,
                                                      std::vector<long long> const&,
                                                      std::vector<double>&);
template double mSelectOrderStat<long long, int>(long long, double const*, std::vector<int> const&);
template double mSelectOrderStat<long long, long long>(long long, double const*,
                                                       std::vector<long long> const&);

int mLowerBound(int k, std::vector<int> const& cumulative, int first, int last) {
  int size = static_cast<int>(cumulative.size());
  // Without a tie below the k-th observation it sits at index k - 1.
  if (k > 0 && k <= size && cumulative[k - 1] == k) return k - 1;
  int lo = std::max(first, 0);
  int end = (last < 0 || last >= size) ? size : last + 1;
  if (lo >= end) return end;
  return static_cast<int>(std::lower_bound(cumulative.begin() + lo, cumulative.begin() + end, k) -
                          cumulative.begin());
}

}  // namespace qel
