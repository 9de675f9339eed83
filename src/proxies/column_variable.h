// A light view of a data column together with the rule that orders its
// values when the column groups rows: ascending numbers, the order in which
// values are first met, or the order of a caller-supplied value list.
#ifndef QEL_SRC_PROXIES_COLUMN_VARIABLE_H
#define QEL_SRC_PROXIES_COLUMN_VARIABLE_H

#include <vector>

namespace qel {

enum EDefinedSortOrder {
  eNaturalSortOrder = 0,           // ascending numeric
  eFirstEncounteredSortOrder = 1,  // the order in which values first occur
  eValueListSortOrder = 2          // the order of an ordering list
};

template <typename T>
class CmColumnVar {
 public:
  CmColumnVar() : mData(nullptr), mOrdering(nullptr), mSortOrder(eNaturalSortOrder) {}
  CmColumnVar(const std::vector<T>* data, EDefinedSortOrder order)
      : mData(data), mOrdering(nullptr), mSortOrder(order) {}

  void mSetRawData(const std::vector<T>* data) { mData = data; }
  void mSetSortOrder(EDefinedSortOrder order) { mSortOrder = order; }
  // Orders the values by the list; values absent from it follow, ascending.
  void mSetSortOrder(const std::vector<T>* ordering) {
    mOrdering = ordering;
    mSortOrder = eValueListSortOrder;
  }
  // Writes n copies of value into the borrowed column. The column is the
  // caller's: the view only lends the write.
  void mClearAndResize(unsigned long n, T value) {
    if (mData != nullptr) const_cast<std::vector<T>*>(mData)->assign(n, value);
  }

  const std::vector<T>* mGetDataValues() const { return mData; }
  const std::vector<T>* mGetOrdering() const { return mOrdering; }
  EDefinedSortOrder mGetDefinedSortOrder() const { return mSortOrder; }

 private:
  const std::vector<T>* mData;
  const std::vector<T>* mOrdering;
  EDefinedSortOrder mSortOrder;
};

// The length of the longest column; null columns count 0.
unsigned long mGetMaxRowCt(const std::vector<const std::vector<double>*>& columns);
unsigned long mGetMaxRowCt(const std::vector<const CmColumnVar<double>*>& columns);

}  // namespace qel

#endif
