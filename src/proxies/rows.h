// Sets of 1-based row numbers. A set that is just 1, 2, ..., n keeps no list
// at all, only n and the use-all-rows flag, so that the common case of every
// row of a column costs neither memory nor allocation. Order is significant
// in the list form: a row set is also a permutation of rows.
#ifndef QEL_SRC_PROXIES_ROWS_H
#define QEL_SRC_PROXIES_ROWS_H

#include <type_traits>
#include <vector>

namespace qel {

template <typename T>
class CmColumnVar;

class CbRows {
 public:
  CbRows();
  CbRows(const CbRows& other);
  CbRows& operator=(const CbRows& other);
  virtual ~CbRows();
  virtual CbRows* mClone() const;

  int mGetRowCt() const { return mRowCount; }
  bool mIsUseAllRows() const { return mUseAll; }
  // The row at the 0-based position i. Positions are not tested.
  int mGetRow(int i) const { return mUseAll ? i + 1 : mRows[static_cast<std::size_t>(i)]; }
  void mGetAllRows(std::vector<int>& rows) const;
  // Sets flags[row - 1] for every row; the caller sizes and clears flags.
  void mGetRowFlags(int n, std::vector<bool>& flags) const;

  void mClear();
  void mUseAllRows(int n);
  // Takes the list; keeps the compressed form when it is exactly 1 .. n.
  int mInitialize(const std::vector<int>& rows);
  // Capacity for the list, honoured the next time a row is pushed to it.
  void mReserve(int n);
  // Appends a row. In the compressed form a row at or below the new count is
  // not kept as such (the set stays 1 .. count): callers that start from an
  // empty set push rows in strictly ascending order.
  void mPushBack(int row);
  void mSetRow(int i, int row);
  void mConvertFromUseAllRows();
  void mSwapRows(int i, int j);
  void mSort();

  // Appends the rows of other not yet present, in other's order; returns how
  // many were appended.
  int mAppendRows(const CbRows& other);
  // Appends every row of other, duplicates included; returns other's count.
  int mAppendUniqueRows(const CbRows& other);

  // Each returns the number of rows removed.
  int mFilterRowsExclude(const CbRows& other);
  int mFilterRowsInclude(const CbRows& other);
  int mFilterRowsInclude(int maxRow);

  bool operator==(const CbRows& other) const;
  bool operator!=(const CbRows& other) const { return !(*this == other); }

 protected:
  int mFilterRowsInternal(const CbRows& other, bool include);

  int mPendingReserve;
  bool mUseAll;
  int mRowCount;
  std::vector<int> mRows;
};

// Rows filtered by the missing value of data columns.
class CmRows : public CbRows {
 public:
  CmRows() = default;
  CmRows(const CmRows& other) = default;
  CmRows& operator=(const CmRows& other) = default;
  ~CmRows() override;
  CmRows* mClone() const override;

  // Drops the rows beyond the shortest column, and the rows at whose
  // position (not row - 1; the two agree for a compressed set) any column
  // holds the missing value. Returns the new count.
  int mFilterExcludeMissings(const std::vector<double>* column);
  int mFilterExcludeMissings(const std::vector<const std::vector<double>*>& columns);
  // The same on the data of column variables (a null variable reads no data).
  // A template only so that a braced list of data columns, which could also
  // name a vector of variables by its iterator-pair constructor, keeps
  // choosing the form above.
  template <typename Column,
            typename = std::enable_if_t<std::is_same<Column, CmColumnVar<double>>::value>>
  int mFilterExcludeMissings(const std::vector<const Column*>& columns) {
    return mFilterExcludeMissingVariables(columns);
  }

  // The rows 1 .. m (m the shortest length) at which no column is missing.
  int mInitializeWithNonMissings(const std::vector<double>* column);
  int mInitializeWithNonMissings(const std::vector<const std::vector<double>*>& columns);

 private:
  int mFilterExcludeMissingVariables(const std::vector<const CmColumnVar<double>*>& columns);
};

}  // namespace qel

#endif
