// Weighted selection (three-way quickselect in the manner of Hoare's FIND),
// the median of three and the lower bound over cumulative frequencies.
#include <algorithm>
#include <limits>
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

// A value with its weight. The list is partitioned in place; entries of
// weight zero never hold a rank and are left out from the start.
template <typename W>
struct Weighted {
  double value;
  W weight;
};

// A part of the list still to be partitioned, with the ranks (a range of the
// sorted rank list) that fall inside it and the weight below it.
template <typename R>
struct SelectTask {
  std::size_t first, last;  // items [first, last)
  std::size_t rankFirst, rankLast;
  R base;
};

// Pivot of a round: the median of three for a rank of 2 or more, which keeps
// sorted and reversed inputs linear; for rank 1 the smallest value, which is
// the answer itself.
template <typename W>
double choosePivot(long double remainingRank, std::vector<Weighted<W>> const& items,
                   std::size_t first, std::size_t last) {
  if (remainingRank >= 2) {
    return mMedianOfThree(items[first].value, items[first + (last - 1 - first) / 2].value,
                          items[last - 1].value);
  }
  double pivot = items[first].value;
  for (std::size_t i = first + 1; i < last; ++i) {
    if (items[i].value < pivot) pivot = items[i].value;
  }
  return pivot;
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

  std::vector<Weighted<W>> items;
  items.reserve(weights.size());
  for (std::size_t i = 0; i < weights.size(); ++i) {
    if (weights[i] > 0) items.push_back({values[i], weights[i]});
  }
  std::vector<SelectTask<R>> pending;
  pending.push_back({0, items.size(), 0, rankOrder.size(), R(0)});
  while (!pending.empty()) {
    SelectTask<R> task = pending.back();
    pending.pop_back();
    if (task.rankFirst == task.rankLast || task.first == task.last) continue;
    long double remaining = static_cast<long double>(ranks[rankOrder[task.rankFirst]]) - task.base;
    double pivot = choosePivot(remaining, items, task.first, task.last);

    // Three-way split in two branch-free Lomuto passes (the comparisons of
    // a selection are unpredictable, so moving every item costs less than
    // a mispredicted branch). First [first, lo) below the pivot.
    std::size_t lo = task.first;
    R weightBelow = 0;
    for (std::size_t i = task.first; i < task.last; ++i) {
      Weighted<W> item = items[i];
      bool below = item.value < pivot;
      items[i] = items[lo];
      items[lo] = item;
      lo += below;
      weightBelow += below ? item.weight : W(0);
    }
    std::size_t r = task.rankFirst;
    while (r < task.rankLast && ranks[rankOrder[r]] - task.base <= weightBelow) ++r;
    if (r > task.rankFirst) pending.push_back({task.first, lo, task.rankFirst, r, task.base});
    if (r == task.rankLast) continue;

    // Then [lo, mid) equal to the pivot (and incomparable, such as NaN),
    // [mid, last) above it.
    std::size_t mid = lo;
    R weightEqual = 0;
    for (std::size_t i = lo; i < task.last; ++i) {
      Weighted<W> item = items[i];
      bool equal = !(item.value > pivot);
      items[i] = items[mid];
      items[mid] = item;
      mid += equal;
      weightEqual += equal ? item.weight : W(0);
    }
    while (r < task.rankLast && ranks[rankOrder[r]] - task.base <= weightBelow + weightEqual) {
      result[rankOrder[r]] = pivot;
      ++r;
    }
    if (r < task.rankLast) {
      pending.push_back({mid, task.last, r, task.rankLast, task.base + weightBelow + weightEqual});
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
