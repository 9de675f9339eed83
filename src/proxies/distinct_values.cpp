// Distinct values of a column and their subscripts.
#include "proxies/distinct_values.h"

#include <cstddef>

#include "proxies/value_index.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {

namespace {

int unknownSubscript() {
  return static_cast<int>(mGetMaxInteger());
}

const std::vector<double>* dataOf(const CmColumnVar<double>* column) {
  return column != nullptr ? column->mGetDataValues() : nullptr;
}

}  // namespace

template <typename T>
int CmDistinctValues<T>::mMode() const {
  if (mNatural) return eNaturalSortOrder;
  if (mFirstEncountered) return eFirstEncounteredSortOrder;
  return mColumn != nullptr ? mColumn->mGetDefinedSortOrder() : eNaturalSortOrder;
}

template <typename T>
void CmDistinctValues<T>::mFindDistinctValues(const CmColumnVar<T>* column, const CbRows& rows) {
  mFindDistinctValues(column, rows, nullptr);
}

template <typename T>
void CmDistinctValues<T>::mFindDistinctValues(const CmColumnVar<T>* column, const CbRows& rows,
                                              std::vector<int>* positionSubscripts) {
  mColumn = column;
  const int mode = mMode();
  mMap.clear();
  const std::vector<T>* data = dataOf(column);
  const long long length = data != nullptr ? static_cast<long long>(data->size()) : 0;
  const int count = rows.mGetRowCt();
  // A flat hash finds the distinct values in one pass; only they go into
  // the map, in the order first met.
  CmValueIndex seen;
  std::vector<T> firstMet;
  if (positionSubscripts != nullptr)
    positionSubscripts->assign(static_cast<std::size_t>(count), -1);
  for (int i = 0; i < count; ++i) {
    const int row = rows.mGetRow(i);
    if (row < 1 || row > length) continue;
    const T value = (*data)[static_cast<std::size_t>(row - 1)];
    bool inserted = false;
    const int id = seen.mFindOrInsert(value, &inserted);
    if (inserted) firstMet.push_back(value);
    if (positionSubscripts != nullptr) (*positionSubscripts)[static_cast<std::size_t>(i)] = id;
  }
  int next = 0;
  for (const T& value : firstMet)
    mMap.emplace(value, mode == eFirstEncounteredSortOrder ? next++ : -1);
  if (mode == eValueListSortOrder && column->mGetOrdering() != nullptr) {
    for (const T& value : *column->mGetOrdering()) {
      const auto found = mMap.find(value);
      if (found != mMap.end() && found->second < 0) found->second = next++;
    }
  }
  if (mode != eFirstEncounteredSortOrder) {
    for (auto& entry : mMap) {
      if (entry.second < 0) entry.second = next++;
    }
  }
  if (positionSubscripts != nullptr) {
    // First-met ids to subscripts; skipped rows keep the unknown subscript.
    std::vector<int> subscriptOfId(firstMet.size());
    for (std::size_t id = 0; id < firstMet.size(); ++id)
      subscriptOfId[id] = mMap.find(firstMet[id])->second;
    for (int& s : *positionSubscripts)
      s = s < 0 ? unknownSubscript() : subscriptOfId[static_cast<std::size_t>(s)];
  }
  mColumn = column;
}

template <typename T>
void CmDistinctValues<T>::mFindDistinctValues(const CmColumnVar<T>* column) {
  CbRows rows;
  const std::vector<T>* data = dataOf(column);
  rows.mUseAllRows(data != nullptr ? static_cast<int>(data->size()) : 0);
  mFindDistinctValues(column, rows);
}

template <typename T>
void CmDistinctValues<T>::mFindDistinctValues(const CmColumnVar<T>* column,
                                              const std::vector<int>& rows) {
  CbRows set;
  set.mInitialize(rows);
  mFindDistinctValues(column, set);
}

template <typename T>
int CmDistinctValues<T>::mGetSubscript(int row) const {
  return mGetSubscript(row, dataOf(mColumn));
}

template <typename T>
int CmDistinctValues<T>::mGetSubscript(int row, const std::vector<T>* data) const {
  if (data == nullptr || row < 1 || static_cast<std::size_t>(row) > data->size())
    return unknownSubscript();
  return mGetSubscript((*data)[static_cast<std::size_t>(row - 1)]);
}

template <typename T>
int CmDistinctValues<T>::mGetSubscript(T value) const {
  const auto found = mMap.find(value);
  return found == mMap.end() ? unknownSubscript() : found->second;
}

template <typename T>
T CmDistinctValues<T>::mGetDistinctDataValue(int subscript) const {
  for (const auto& entry : mMap) {
    if (entry.second == subscript) return entry.first;
  }
  return mGetMissingValueCode();
}

template <typename T>
void CmDistinctValues<T>::mGetDistinctValues(std::vector<T>& values) const {
  values.assign(mMap.size(), mGetMissingValueCode());
  for (const auto& entry : mMap) values[static_cast<std::size_t>(entry.second)] = entry.first;
}

template <typename T>
bool CmDistinctValues<T>::mIsValueMissing(int subscript) const {
  for (const auto& entry : mMap) {
    if (entry.second == subscript) return mIsNumericMissing(entry.first);
  }
  return false;
}

template <typename T>
void CmDistinctValues<T>::mStoreGroupingVarValue(int subscript, std::vector<T>& out) const {
  out.push_back(mGetDistinctDataValue(subscript));
}

template <typename T>
void CmDistinctValues<T>::mStoreGroupingVarValue(int subscript, int index,
                                                 std::vector<T>& out) const {
  if (index < 0) return;
  const auto at = static_cast<std::size_t>(index);
  if (at >= out.size()) out.resize(at + 1, mGetMissingValueCode());
  out[at] = mGetDistinctDataValue(subscript);
}

template <typename T>
void CmDistinctValues<T>::mUpdateGroupID(std::vector<unsigned long long>& ids,
                                         const CbRows& rows) const {
  const int count = rows.mGetRowCt();
  ids.resize(static_cast<std::size_t>(count), 0ULL);
  const auto radix = static_cast<unsigned long long>(mMap.size());
  for (int i = 0; i < count; ++i) {
    const auto s = static_cast<unsigned long long>(mGetSubscript(rows.mGetRow(i)));
    ids[static_cast<std::size_t>(i)] = ids[static_cast<std::size_t>(i)] * radix + s;
  }
}

template class CmDistinctValues<double>;

}  // namespace qel
