// The stable position sort of CmSortTool, instantiated for int and double.
#include "proxies/SortTool.h"

#include <algorithm>
#include <cstddef>

namespace qel {

template <typename T>
void CmSortTool<T>::mSort(const std::vector<T>& data, const CbRows& rows, bool reset,
                          bool ascending) {
  const int n = rows.mGetRowCt();
  // A refining sort over a set of another size (or before any sort) has no
  // order to refine: start from the identity then.
  if (reset || n != mCount || static_cast<int>(mPositions.size()) != n) {
    mCount = n;
    mPositions.resize(static_cast<std::size_t>(n));
    for (int i = 0; i < n; ++i) mPositions[static_cast<std::size_t>(i)] = i;
  }
  mAux = 0;
  mFlag = false;
  std::stable_sort(mPositions.begin(), mPositions.end(),
                   CmSortToolPredicate<T>(data, rows, ascending));
}

template <typename T>
void CmSortTool<T>::mSort(const std::vector<T>& data, bool reset, bool ascending) {
  CbRows all;
  all.mUseAllRows(static_cast<int>(data.size()));
  mSort(data, all, reset, ascending);
}

template <typename T>
void CmSortTool<T>::mGetSortedRowNumbers(CbRows& rows) const {
  // The set is sized first so that every position exists when it is set.
  rows.mUseAllRows(mCount);
  rows.mReserve(mCount);
  for (int i = 0; i < mCount; ++i) rows.mSetRow(i, mPositions[static_cast<std::size_t>(i)] + 1);
}

template class CmSortTool<int>;
template class CmSortTool<double>;

}  // namespace qel
