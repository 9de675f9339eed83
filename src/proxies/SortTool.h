// Sorting row positions of a column without moving the data. The sort is
// stable, so sorts in turn without a reset make a multi-key sort, the least
// significant key first.
#ifndef QEL_SRC_PROXIES_SORT_TOOL_H
#define QEL_SRC_PROXIES_SORT_TOOL_H

#include <vector>

#include "proxies/rows.h"

namespace qel {

// Compares two positions of a row set by the data at their rows. Values are
// compared exactly.
template <typename T>
class CmSortToolPredicate {
 public:
  CmSortToolPredicate(const std::vector<T>& data, const CbRows& rows, bool ascending)
      : mData(data), mRows(rows), mAscending(ascending) {}
  bool operator()(int i, int j) const {
    const T& a = mData[static_cast<std::size_t>(mRows.mGetRow(i) - 1)];
    const T& b = mData[static_cast<std::size_t>(mRows.mGetRow(j) - 1)];
    return mAscending ? a < b : b < a;
  }

 private:
  const std::vector<T>& mData;
  const CbRows& mRows;
  bool mAscending;
};

template <typename T>
class CmSortTool {
 public:
  CmSortTool() : mAux(0), mCount(0), mFlag(false) {}

  // Sorts the positions 0 .. count - 1 of rows by data[row - 1]. With reset
  // false the present order is refined instead of restarted; the caller then
  // passes a set of the same row count.
  void mSort(const std::vector<T>& data, const CbRows& rows, bool reset, bool ascending);
  // The same over all rows of the data.
  void mSort(const std::vector<T>& data, bool reset, bool ascending);
  // Sets rows to the sorted positions plus one: row numbers when the sort was
  // over all rows of the data.
  void mGetSortedRowNumbers(CbRows& rows) const;
  const std::vector<int>& mGetSortedPositions() const { return mPositions; }

 private:
  std::vector<int> mPositions;
  int mAux;  // set to 0 by each sort; kept for the record layout
  int mCount;
  bool mFlag;  // set to false by each sort; kept for the record layout
};

extern template class CmSortTool<int>;
extern template class CmSortTool<double>;

}  // namespace qel

#endif
