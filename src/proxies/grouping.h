// Groups of rows by the value combinations of one or more grouping columns.
// The groups come in the order of a stable sort of the rows on all grouping
// columns together, each column by its own ordering rule, which is the order
// of the host's output tables.
#ifndef QEL_SRC_PROXIES_GROUPING_H
#define QEL_SRC_PROXIES_GROUPING_H

#include <cstddef>
#include <cstdint>
#include <vector>

#include "proxies/Frequencies.h"
#include "proxies/column_variable.h"
#include "proxies/distinct_values.h"
#include "proxies/rows.h"

namespace qel {

// Strict ordering of 0-based data indices by per-column keys. The first
// column whose keys differ (a NaN key counts as differing) decides, negated
// for a descending column; indices whose keys all tie compare false.
template <typename T>
class CmSortCompare {
 public:
  CmSortCompare(std::vector<const T*> keys, std::vector<bool> ascending)
      : mKeys(std::move(keys)), mAscending(std::move(ascending)), mColumnCt(mKeys.size()) {}
  bool operator()(int i, int j) const {
    bool less = false;
    for (std::size_t c = 0; c < mColumnCt; ++c) {
      const T a = mKeys[c][i];
      const T b = mKeys[c][j];
      less = a < b;
      if (a != b) return mAscending[c] ? less : !less;
    }
    return less;
  }

 private:
  std::vector<const T*> mKeys;
  std::vector<bool> mAscending;
  std::size_t mColumnCt;
};

// Merges two sorted runs into out; on ties the first run's element goes
// first, which makes the merge sort stable.
template <typename Item, typename Compare>
Item* mMerge(const Compare& compare, const Item* first1, const Item* last1, const Item* first2,
             const Item* last2, Item* out) {
  while (first1 != last1 && first2 != last2) {
    if (compare(*first2, *first1)) {
      *out++ = *first2++;
    } else {
      *out++ = *first1++;
    }
  }
  while (first1 != last1) *out++ = *first1++;
  while (first2 != last2) *out++ = *first2++;
  return out;
}

// Bottom-up stable merge sort: runs of width 1, 2, 4, ... merged in pairs
// between the items and a work vector; a short tail merges what it has.
template <typename Item, typename Compare>
void mMergeSort(std::vector<Item>& items, const Compare& compare) {
  const std::size_t n = items.size();
  if (n < 2) return;
  std::vector<Item> work(n);
  Item* from = items.data();
  Item* to = work.data();
  for (std::size_t width = 1; width < n; width *= 2) {
    for (std::size_t start = 0; start < n; start += 2 * width) {
      const std::size_t tail = n - start;
      const std::size_t len1 = tail < width ? tail : width;
      const std::size_t rest = tail - len1;
      const std::size_t len2 = rest < width ? rest : width;
      mMerge(compare, from + start, from + start + len1, from + start + len1,
             from + start + len1 + len2, to + start);
    }
    std::swap(from, to);
  }
  if (from != items.data()) std::copy(from, from + n, items.data());
}

// Sorts 0-based data indices stably on the columns, keyed as the grouping
// orders them: raw values (natural), first-encounter subscripts over the
// whole column, or the order of the column's distinct values under its
// ordering list (listed values first, the rest after them, ascending).
void mIndexedSortByCols(const std::vector<const CmColumnVar<double>*>& columns,
                        std::vector<int>& index, const std::vector<bool>& ascending, bool natural,
                        bool firstEncountered);

template <typename T>
class CmGrouping;

// Compares a group with a row by their subscripts, column by column, in the
// order in which the grouping sorted its groups.
template <typename T>
class CmCompareSubscripts {
 public:
  CmCompareSubscripts(const CmGrouping<T>& grouping, int row, std::vector<int> subscripts)
      : mGrouping(grouping), mRow(row), mSubscripts(std::move(subscripts)) {}
  // Negative, zero or positive as the group comes before, with or after the row.
  int operator()(int group) const;
  int mGetRow() const { return mRow; }

 private:
  const CmGrouping<T>& mGrouping;
  int mRow;
  std::vector<int> mSubscripts;
};

template <typename T>
class CmGrouping {
 public:
  CmGrouping() = default;

  void mUseNaturalOrder() {
    mNatural = true;
    mFirstEncountered = false;
  }
  void mUseFirstEncounteredOrder() {
    mNatural = false;
    mFirstEncountered = true;
  }
  void mUseDefaultOrder() {
    mNatural = false;
    mFirstEncountered = false;
  }

  // Returns 0, or 30023 when all combinations are asked for and their count
  // does not fit 31 bits (no group is built then). The first bool is unused.
  // Rows outside a column are left out of every group.
  int mFindGrouping(const std::vector<const CmColumnVar<T>*>& columns, const CbRows& rows, bool,
                    bool allCombinations, bool useRowNumbers);
  int mFindGrouping(const CmColumnVar<T>* column, const CbRows& rows, bool unused,
                    bool allCombinations, bool useRowNumbers);
  int mFindGrouping(const std::vector<const CmColumnVar<T>*>& columns, const std::vector<int>& rows,
                    bool unused, bool allCombinations, bool useRowNumbers);
  int mFindGrouping(const CmColumnVar<T>* column, const std::vector<int>& rows, bool unused,
                    bool allCombinations, bool useRowNumbers);
  int mFindGrouping(const std::vector<const CmColumnVar<T>*>& columns, bool unused,
                    bool allCombinations, bool useRowNumbers);
  int mFindGrouping(const CmColumnVar<T>* column, bool unused, bool allCombinations,
                    bool useRowNumbers);
  void mClear();

  int mGetNumberOfGroups() const { return mGroupCount; }
  int mGetGroupSize(int group) const;
  int mGetNumGroupingCols() const { return static_cast<int>(mColumns.size()); }
  void mGetGroupingCols(std::vector<const CmColumnVar<T>*>& columns) const { columns = mColumns; }
  int mGetDistinctValueCt(int column) const;
  int mGetRowCt() const { return mRowCount; }

  void mGetRowsInGroup(int group, CbRows& rows) const;
  void mGetRowsInGroup(int group, std::vector<int>& rows) const;
  // The group of a 1-based row, or -1 for a row whose values form no group.
  int mGetGroup(int row) const;
  int mGetSubscript(int row, int column) const;
  void mGetSubscripts(int row, std::vector<int>& subscripts) const;
  int mGetSubscriptFromGroup(int group, int column) const;
  void mGetSubscriptsFromGroup(int group, std::vector<int>& subscripts) const;
  void mGetValues(int group, std::vector<T>& values) const;
  bool mIsValueMissing(int group, int column) const;
  // Appends the group's value of the column to out.
  void mStoreGroupingVarValue(int group, int column, std::vector<T>& out) const;
  int mGetGroupFrequency(int group, const CbFrequencies& frequencies, int column) const;
  // indicators[m - 1] is the group of member m (a row number, or a sorted
  // position); -1 where no group holds it.
  void mGetGroupIndicators(std::vector<int>& indicators) const;
  void mRecoverRowsToUse(CbRows& rows) const;

  // The place of a column's subscript in the sort order of the groups.
  int mOrderOfSubscript(int column, int subscript) const {
    return mOrder[static_cast<std::size_t>(column)][static_cast<std::size_t>(subscript)];
  }

 private:
  int mFindRowNumbersForGroups(const CbRows& rows, bool useRowNumbers);
  void mBuildSortKeys(const CbRows& rows, std::vector<std::vector<int>>& ranks);
  void mSortPositions(const std::vector<std::vector<int>>& ranks, std::vector<int>& order,
                      std::vector<std::uint64_t>& sortedKeys) const;
  bool mValidGroup(int group) const { return group >= 0 && group < mGroupCount; }

  std::vector<const CmColumnVar<T>*> mColumns;
  std::vector<CmDistinctValues<T>> mDistinct;
  std::vector<std::vector<int>> mGroups;
  int mGroupCount = 0;
  int mRowCount = 0;
  bool mNatural = false;
  bool mFirstEncountered = false;
  bool mCompact = true;
  // Per column, the sort place of each subscript; per compact group, the
  // subscripts of its values (column after column).
  std::vector<std::vector<int>> mOrder;
  std::vector<int> mGroupSubscripts;
  // Scratch of mFindGrouping: the subscript at each row position, per column.
  std::vector<std::vector<int>> mSubscriptsOfPositions;
};

extern template class CmGrouping<double>;
extern template class CmCompareSubscripts<double>;

}  // namespace qel

#endif
