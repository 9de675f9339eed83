// Grouping of rows: distinct values per column, a stable sort of the rows on
// all columns, and runs of equal values as groups.
//
// Every column's values are first replaced by their place in the column's
// order (an int from 0), so that the sort and the run detection compare
// small integers rather than chase data through row numbers. Where the
// product of the distinct counts is small the stable sort is a counting sort
// on the combined place, otherwise a merge sort of (combined place, position)
// pairs; both give exactly the order of the stable merge sort on the columns.
#include "proxies/grouping.h"

#include <algorithm>
#include <cstdint>
#include <limits>
#include <utility>

#include "proxies/value_index.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {

namespace {

constexpr int kTooManyGroups = 30023;

int unknownSubscript() {
  return static_cast<int>(mGetMaxInteger());
}

std::size_t at(int i) {
  return static_cast<std::size_t>(i);
}

const std::vector<double>* dataOf(const CmColumnVar<double>* column) {
  return column != nullptr ? column->mGetDataValues() : nullptr;
}

// The rows that every column holds: rows below 1 or beyond the shortest
// column are dropped, the order of the others kept.
CbRows usableRows(const std::vector<const CmColumnVar<double>*>& columns, const CbRows& rows) {
  long long shortest = columns.empty() ? 0 : std::numeric_limits<long long>::max();
  for (const auto* column : columns) {
    const auto* data = dataOf(column);
    shortest = std::min(shortest, data != nullptr ? static_cast<long long>(data->size()) : 0LL);
  }
  CbRows usable;
  if (rows.mIsUseAllRows()) {
    usable.mUseAllRows(static_cast<int>(std::min<long long>(rows.mGetRowCt(), shortest)));
    return usable;
  }
  usable.mReserve(rows.mGetRowCt());
  for (int i = 0; i < rows.mGetRowCt(); ++i) {
    const int row = rows.mGetRow(i);
    if (row < 1 || row > shortest) continue;
    if (usable.mIsUseAllRows() && row != usable.mGetRowCt() + 1) usable.mConvertFromUseAllRows();
    usable.mPushBack(row);
  }
  return usable;
}

// The ordering mode of a column under the grouping's switches.
int modeOf(const CmColumnVar<double>* column, bool natural, bool firstEncountered) {
  if (natural) return eNaturalSortOrder;
  if (firstEncountered) return eFirstEncounteredSortOrder;
  return column->mGetDefinedSortOrder();
}

// Subscripts over all rows of the column, for every data index, as doubles.
std::vector<double> wholeColumnSubscripts(const CmColumnVar<double>* column,
                                          bool firstEncountered) {
  CmDistinctValues<double> whole;
  if (firstEncountered) whole.mUseFirstEncounteredOrder();
  whole.mFindDistinctValues(column);
  const std::vector<double>& data = *column->mGetDataValues();
  std::vector<double> keys(data.size());
  for (std::size_t i = 0; i < data.size(); ++i) keys[i] = whole.mGetSubscript(data[i]);
  return keys;
}

// Stable counting sort of positions 0 .. n - 1 by keys below range.
void countingSort(const std::vector<std::uint64_t>& keys, std::uint64_t range,
                  std::vector<int>& order, std::vector<std::uint64_t>& sortedKeys) {
  std::vector<int> starts(static_cast<std::size_t>(range) + 1, 0);
  for (const auto key : keys) ++starts[static_cast<std::size_t>(key) + 1];
  for (std::size_t k = 1; k < starts.size(); ++k) starts[k] += starts[k - 1];
  order.assign(keys.size(), 0);
  for (std::size_t p = 0; p < keys.size(); ++p)
    order[at(starts[static_cast<std::size_t>(keys[p])]++)] = static_cast<int>(p);
  // Bucket k now ends at starts[k]: the sorted keys without a gather.
  sortedKeys.resize(keys.size());
  std::size_t from = 0;
  for (std::size_t k = 0; k + 1 < starts.size(); ++k) {
    const auto to = static_cast<std::size_t>(starts[k]);
    std::fill(sortedKeys.begin() + static_cast<std::ptrdiff_t>(from),
              sortedKeys.begin() + static_cast<std::ptrdiff_t>(to), static_cast<std::uint64_t>(k));
    from = to;
  }
}

}  // namespace

void mIndexedSortByCols(const std::vector<const CmColumnVar<double>*>& columns,
                        std::vector<int>& index, const std::vector<bool>& ascending, bool natural,
                        bool firstEncountered) {
  std::vector<std::vector<double>> owned;
  owned.reserve(columns.size());
  std::vector<const double*> keys;
  for (const auto* column : columns) {
    const int mode = modeOf(column, natural, firstEncountered);
    if (mode == eNaturalSortOrder) {
      keys.push_back(column->mGetDataValues()->data());
    } else {
      owned.push_back(wholeColumnSubscripts(column, mode == eFirstEncounteredSortOrder));
      keys.push_back(owned.back().data());
    }
  }
  std::vector<bool> directions = ascending;
  directions.resize(columns.size(), true);
  mMergeSort(index, CmSortCompare<double>(keys, directions));
}

template <typename T>
int CmCompareSubscripts<T>::operator()(int group) const {
  for (std::size_t c = 0; c < mSubscripts.size(); ++c) {
    const int column = static_cast<int>(c);
    const int a =
        mGrouping.mOrderOfSubscript(column, mGrouping.mGetSubscriptFromGroup(group, column));
    const int b = mGrouping.mOrderOfSubscript(column, mSubscripts[c]);
    if (a != b) return a < b ? -1 : 1;
  }
  return 0;
}

template <typename T>
void CmGrouping<T>::mClear() {
  mColumns.clear();
  mDistinct.clear();
  mGroups.clear();
  mGroupCount = 0;
  mRowCount = 0;
  mCompact = true;
  mOrder.clear();
  mGroupSubscripts.clear();
}

template <typename T>
int CmGrouping<T>::mFindGrouping(const std::vector<const CmColumnVar<T>*>& columns,
                                 const CbRows& rows, bool, bool allCombinations,
                                 bool useRowNumbers) {
  mClear();
  mColumns = columns;
  mCompact = !allCombinations;
  const CbRows usable = usableRows(columns, rows);
  mRowCount = usable.mGetRowCt();
  for (const auto* column : columns) {
    CmDistinctValues<T> distinct;
    if (mNatural) distinct.mUseNaturalOrder();
    if (mFirstEncountered) distinct.mUseFirstEncounteredOrder();
    mSubscriptsOfPositions.emplace_back();
    distinct.mFindDistinctValues(column, usable, &mSubscriptsOfPositions.back());
    mDistinct.push_back(std::move(distinct));
  }
  const int code = mFindRowNumbersForGroups(usable, useRowNumbers);
  mSubscriptsOfPositions.clear();
  mSubscriptsOfPositions.shrink_to_fit();
  return code;
}

template <typename T>
int CmGrouping<T>::mFindGrouping(const CmColumnVar<T>* column, const CbRows& rows, bool unused,
                                 bool allCombinations, bool useRowNumbers) {
  return mFindGrouping(std::vector<const CmColumnVar<T>*>{column}, rows, unused, allCombinations,
                       useRowNumbers);
}

template <typename T>
int CmGrouping<T>::mFindGrouping(const std::vector<const CmColumnVar<T>*>& columns,
                                 const std::vector<int>& rows, bool unused, bool allCombinations,
                                 bool useRowNumbers) {
  CbRows set;
  set.mInitialize(rows);
  return mFindGrouping(columns, set, unused, allCombinations, useRowNumbers);
}

template <typename T>
int CmGrouping<T>::mFindGrouping(const CmColumnVar<T>* column, const std::vector<int>& rows,
                                 bool unused, bool allCombinations, bool useRowNumbers) {
  return mFindGrouping(std::vector<const CmColumnVar<T>*>{column}, rows, unused, allCombinations,
                       useRowNumbers);
}

template <typename T>
int CmGrouping<T>::mFindGrouping(const std::vector<const CmColumnVar<T>*>& columns, bool unused,
                                 bool allCombinations, bool useRowNumbers) {
  CbRows set;
  const auto* data = columns.empty() ? nullptr : dataOf(columns.front());
  set.mUseAllRows(data != nullptr ? static_cast<int>(data->size()) : 0);
  return mFindGrouping(columns, set, unused, allCombinations, useRowNumbers);
}

template <typename T>
int CmGrouping<T>::mFindGrouping(const CmColumnVar<T>* column, bool unused, bool allCombinations,
                                 bool useRowNumbers) {
  return mFindGrouping(std::vector<const CmColumnVar<T>*>{column}, unused, allCombinations,
                       useRowNumbers);
}

template <typename T>
void CmGrouping<T>::mBuildSortKeys(const CbRows& rows, std::vector<std::vector<int>>& ranks) {
  mOrder.assign(mColumns.size(), {});
  ranks.assign(mColumns.size(), {});
  for (std::size_t c = 0; c < mColumns.size(); ++c) {
    const CmDistinctValues<T>& distinct = mDistinct[c];
    std::vector<int>& order = mOrder[c];
    order.resize(at(distinct.mGetDistinctValueCt()));
    for (std::size_t s = 0; s < order.size(); ++s) order[s] = static_cast<int>(s);
    // Natural and list orders are the subscript order itself. First-encounter
    // order follows the whole column (a value first met before the row set
    // begins still comes first), while the subscripts follow the row set:
    // the groups are placed by the whole column's subscripts, ranked. Over
    // rows 1 .. m the two orders agree.
    if (modeOf(mColumns[c], mNatural, mFirstEncountered) == eFirstEncounteredSortOrder &&
        !rows.mIsUseAllRows()) {
      CmDistinctValues<T> whole;
      whole.mUseFirstEncounteredOrder();
      whole.mFindDistinctValues(mColumns[c]);
      std::vector<T> values;
      distinct.mGetDistinctValues(values);
      std::vector<std::pair<int, int>> placed;
      for (std::size_t s = 0; s < values.size(); ++s)
        placed.emplace_back(whole.mGetSubscript(values[s]), static_cast<int>(s));
      std::sort(placed.begin(), placed.end());
      for (std::size_t r = 0; r < placed.size(); ++r)
        order[at(placed[r].second)] = static_cast<int>(r);
    }
    // Each position's subscript (found with the distinct values) to its place.
    std::vector<int>& rank = mSubscriptsOfPositions[c];
    for (int& r : rank) r = order[at(r)];
    ranks[c].swap(rank);
  }
}

template <typename T>
void CmGrouping<T>::mSortPositions(const std::vector<std::vector<int>>& ranks,
                                   std::vector<int>& order,
                                   std::vector<std::uint64_t>& sortedKeys) const {
  sortedKeys.clear();
  const std::size_t n = ranks.empty() ? 0 : ranks.front().size();
  std::uint64_t range = 1;
  bool fits = true;
  for (const auto& distinct : mDistinct) {
    const auto k = static_cast<std::uint64_t>(std::max(distinct.mGetDistinctValueCt(), 1));
    if (range > std::numeric_limits<std::uint64_t>::max() / k) fits = false;
    if (fits) range *= k;
  }
  if (!fits) {
    // Combined places beyond 64 bits: the column-by-column merge sort.
    std::vector<std::vector<double>> keys(ranks.size());
    std::vector<const double*> pointers;
    for (std::size_t c = 0; c < ranks.size(); ++c) {
      keys[c].assign(ranks[c].begin(), ranks[c].end());
      pointers.push_back(keys[c].data());
    }
    order.resize(n);
    for (std::size_t p = 0; p < n; ++p) order[p] = static_cast<int>(p);
    mMergeSort(order, CmSortCompare<double>(pointers, std::vector<bool>(ranks.size(), true)));
    return;
  }
  std::vector<std::uint64_t> combined(n, 0);
  for (std::size_t c = 0; c < ranks.size(); ++c) {
    const auto k = static_cast<std::uint64_t>(std::max(mDistinct[c].mGetDistinctValueCt(), 1));
    for (std::size_t p = 0; p < n; ++p)
      combined[p] = combined[p] * k + static_cast<std::uint64_t>(ranks[c][p]);
  }
  if (range <= 4 * static_cast<std::uint64_t>(n) + 4096) {
    countingSort(combined, range, order, sortedKeys);
    return;
  }
  std::vector<std::pair<std::uint64_t, int>> pairs(n);
  for (std::size_t p = 0; p < n; ++p) pairs[p] = {combined[p], static_cast<int>(p)};
  mMergeSort(pairs, [](const std::pair<std::uint64_t, int>& a,
                       const std::pair<std::uint64_t, int>& b) { return a.first < b.first; });
  order.resize(n);
  sortedKeys.resize(n);
  for (std::size_t p = 0; p < n; ++p) {
    order[p] = pairs[p].second;
    sortedKeys[p] = pairs[p].first;
  }
}

template <typename T>
int CmGrouping<T>::mFindRowNumbersForGroups(const CbRows& rows, bool useRowNumbers) {
  const int n = rows.mGetRowCt();
  if (n == 0 || mColumns.empty()) {
    mGroupCount = 0;
    return 0;
  }
  long long combinations = 1;
  if (!mCompact) {
    for (std::size_t c = mDistinct.size(); c-- > 0;) {
      const int count = mDistinct[c].mGetDistinctValueCt();
      if (2147483647LL / count < combinations) return kTooManyGroups;
      combinations *= count;
    }
    mGroups.assign(static_cast<std::size_t>(combinations), {});
  }
  std::vector<std::vector<int>> ranks;
  mBuildSortKeys(rows, ranks);
  std::vector<int> order;
  std::vector<std::uint64_t> sortedKeys;
  mSortPositions(ranks, order, sortedKeys);

  const std::size_t columns = mColumns.size();
  std::size_t start = 0;
  while (start < order.size()) {
    const std::size_t first = at(order[start]);
    std::size_t end = start + 1;
    // Equal combined places are equal values; without them (places beyond
    // 64 bits) the columns are compared one by one.
    if (!sortedKeys.empty()) {
      while (end < order.size() && sortedKeys[end] == sortedKeys[start]) ++end;
    }
    while (sortedKeys.empty() && end < order.size()) {
      const std::size_t next = at(order[end]);
      std::size_t c = columns;
      while (c-- > 0 && ranks[c][next] == ranks[c][first]) {
      }
      if (c != static_cast<std::size_t>(-1)) break;
      ++end;
    }
    const int row = rows.mGetRow(static_cast<int>(first));
    std::size_t group = 0;
    if (mCompact) {
      group = mGroups.size();
      mGroups.emplace_back();
      for (std::size_t k = 0; k < columns; ++k)
        mGroupSubscripts.push_back(mDistinct[k].mGetSubscript(row));
    } else {
      for (std::size_t k = 0; k < columns; ++k)
        group =
            group * at(mDistinct[k].mGetDistinctValueCt()) + at(mDistinct[k].mGetSubscript(row));
    }
    std::vector<int>& members = mGroups[group];
    members.reserve(members.size() + (end - start));
    for (std::size_t k = start; k < end; ++k)
      members.push_back(useRowNumbers ? rows.mGetRow(order[k]) : static_cast<int>(k) + 1);
    start = end;
  }
  mGroupCount = static_cast<int>(mGroups.size());
  return 0;
}

template <typename T>
int CmGrouping<T>::mGetGroupSize(int group) const {
  return mValidGroup(group) ? static_cast<int>(mGroups[at(group)].size()) : 0;
}

template <typename T>
int CmGrouping<T>::mGetDistinctValueCt(int column) const {
  if (column < 0 || at(column) >= mDistinct.size()) return 0;
  return mDistinct[at(column)].mGetDistinctValueCt();
}

template <typename T>
void CmGrouping<T>::mGetRowsInGroup(int group, CbRows& rows) const {
  rows.mInitialize(mValidGroup(group) ? mGroups[at(group)] : std::vector<int>{});
}

template <typename T>
void CmGrouping<T>::mGetRowsInGroup(int group, std::vector<int>& rows) const {
  if (mValidGroup(group)) {
    rows = mGroups[at(group)];
  } else {
    rows.clear();
  }
}

template <typename T>
int CmGrouping<T>::mGetGroup(int row) const {
  if (mGroupCount == 0) return -1;
  std::vector<int> subscripts;
  mGetSubscripts(row, subscripts);
  for (const int s : subscripts) {
    if (s == unknownSubscript()) return -1;
  }
  if (!mCompact) {
    long long group = 0;
    for (std::size_t c = 0; c < subscripts.size(); ++c)
      group = group * mDistinct[c].mGetDistinctValueCt() + subscripts[c];
    return static_cast<int>(group);
  }
  const CmCompareSubscripts<T> compare(*this, row, subscripts);
  int lo = 0;
  int hi = mGroupCount;
  while (lo < hi) {
    const int mid = lo + (hi - lo) / 2;
    const int side = compare(mid);
    if (side == 0) return mid;
    if (side < 0) {
      lo = mid + 1;
    } else {
      hi = mid;
    }
  }
  return -1;
}

template <typename T>
int CmGrouping<T>::mGetSubscript(int row, int column) const {
  if (column < 0 || at(column) >= mDistinct.size()) return unknownSubscript();
  return mDistinct[at(column)].mGetSubscript(row);
}

template <typename T>
void CmGrouping<T>::mGetSubscripts(int row, std::vector<int>& subscripts) const {
  subscripts.clear();
  for (const auto& distinct : mDistinct) subscripts.push_back(distinct.mGetSubscript(row));
}

template <typename T>
int CmGrouping<T>::mGetSubscriptFromGroup(int group, int column) const {
  if (!mValidGroup(group) || column < 0 || at(column) >= mDistinct.size())
    return unknownSubscript();
  if (mCompact) return mGroupSubscripts[at(group) * mDistinct.size() + at(column)];
  // All combinations: the group number is the mixed-radix number of the
  // subscripts, the last column fastest.
  long long rest = group;
  for (std::size_t c = mDistinct.size(); c-- > at(column) + 1;)
    rest /= mDistinct[c].mGetDistinctValueCt();
  return static_cast<int>(rest % mDistinct[at(column)].mGetDistinctValueCt());
}

template <typename T>
void CmGrouping<T>::mGetSubscriptsFromGroup(int group, std::vector<int>& subscripts) const {
  subscripts.clear();
  for (std::size_t c = 0; c < mDistinct.size(); ++c)
    subscripts.push_back(mGetSubscriptFromGroup(group, static_cast<int>(c)));
}

template <typename T>
void CmGrouping<T>::mGetValues(int group, std::vector<T>& values) const {
  values.clear();
  for (std::size_t c = 0; c < mDistinct.size(); ++c)
    mStoreGroupingVarValue(group, static_cast<int>(c), values);
}

template <typename T>
bool CmGrouping<T>::mIsValueMissing(int group, int column) const {
  if (column < 0 || at(column) >= mDistinct.size()) return false;
  return mDistinct[at(column)].mIsValueMissing(mGetSubscriptFromGroup(group, column));
}

template <typename T>
void CmGrouping<T>::mStoreGroupingVarValue(int group, int column, std::vector<T>& out) const {
  if (column < 0 || at(column) >= mDistinct.size()) return;
  mDistinct[at(column)].mStoreGroupingVarValue(mGetSubscriptFromGroup(group, column), out);
}

template <typename T>
int CmGrouping<T>::mGetGroupFrequency(int group, const CbFrequencies& frequencies,
                                      int column) const {
  CbRows rows;
  mGetRowsInGroup(group, rows);
  return frequencies.mGetTotalFrequency(rows, column);
}

template <typename T>
void CmGrouping<T>::mGetGroupIndicators(std::vector<int>& indicators) const {
  int last = 0;
  for (const auto& members : mGroups) {
    for (const int m : members) last = std::max(last, m);
  }
  indicators.assign(at(last), -1);
  for (std::size_t g = 0; g < mGroups.size(); ++g) {
    for (const int m : mGroups[g]) indicators[at(m - 1)] = static_cast<int>(g);
  }
}

template <typename T>
void CmGrouping<T>::mRecoverRowsToUse(CbRows& rows) const {
  rows.mClear();
  rows.mReserve(mRowCount);
  for (const auto& members : mGroups) {
    for (const int m : members) {
      if (rows.mIsUseAllRows() && m != rows.mGetRowCt() + 1) rows.mConvertFromUseAllRows();
      rows.mPushBack(m);
    }
  }
}

template class CmGrouping<double>;
template class CmCompareSubscripts<double>;

}  // namespace qel
