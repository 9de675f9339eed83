// The distinct values of a column over a set of rows, each with a subscript
// 0, 1, 2, ... that follows the column's ordering rule.
#ifndef QEL_SRC_PROXIES_DISTINCT_VALUES_H
#define QEL_SRC_PROXIES_DISTINCT_VALUES_H

#include <cmath>
#include <map>
#include <vector>

#include "proxies/column_variable.h"
#include "proxies/rows.h"

namespace qel {

// Exact numeric order, with every NaN equal to every other and after all
// numbers. On NaN-free data this is std::less; it keeps the map a strict
// weak order should a NaN reach a column anyway.
struct CmValueLess {
  bool operator()(double a, double b) const { return a < b || (!std::isnan(a) && std::isnan(b)); }
};

template <typename T>
class CmDistinctValues {
 public:
  CmDistinctValues() : mColumn(nullptr), mNatural(false), mFirstEncountered(false) {}

  void mUseNaturalOrder() {
    mNatural = true;
    mFirstEncountered = false;
  }
  void mUseFirstEncounteredOrder() {
    mNatural = false;
    mFirstEncountered = true;
  }

  // Rows outside the column (below 1 or beyond its length) are skipped.
  void mFindDistinctValues(const CmColumnVar<T>* column, const CbRows& rows);
  void mFindDistinctValues(const CmColumnVar<T>* column);
  // The main form that also gives the subscript of the value at each
  // position of rows, in the same pass.
  void mFindDistinctValues(const CmColumnVar<T>* column, const CbRows& rows,
                           std::vector<int>* positionSubscripts);
  void mFindDistinctValues(const CmColumnVar<T>* column, const std::vector<int>& rows);

  int mGetDistinctValueCt() const { return static_cast<int>(mMap.size()); }
  // Subscripts of the value at a 1-based row, of a value, or mGetMaxInteger()
  // for a value (or row) that is unknown.
  int mGetSubscript(int row) const;
  int mGetSubscript(int row, const std::vector<T>* data) const;
  int mGetSubscript(T value) const;
  int mFindSubscript(T value) const { return mGetSubscript(value); }

  // The value of a subscript; the missing value for an unknown subscript.
  T mGetDistinctDataValue(int subscript) const;
  void mGetDistinctValues(std::vector<T>& values) const;
  // True only for a known subscript whose value is the missing value.
  bool mIsValueMissing(int subscript) const;
  void mStoreGroupingVarValue(int subscript, std::vector<T>& out) const;
  // Writes at index, growing out when needed; a negative index is ignored.
  void mStoreGroupingVarValue(int subscript, int index, std::vector<T>& out) const;
  // ids[i] = ids[i] x count + subscript of row i of rows: folding the columns
  // first to last gives mixed-radix identifiers with the last column
  // varying fastest. ids is resized (new entries 0) to the row count.
  void mUpdateGroupID(std::vector<unsigned long long>& ids, const CbRows& rows) const;
  bool mEqual(const CmDistinctValues& other) const { return mMap == other.mMap; }

 private:
  int mMode() const;

  std::map<T, int, CmValueLess> mMap;
  const CmColumnVar<T>* mColumn;
  bool mNatural;
  bool mFirstEncountered;
};

extern template class CmDistinctValues<double>;

}  // namespace qel

#endif
