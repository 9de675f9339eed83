// Row sets: the compressed all-rows form and the list form, appending,
// filtering and the missing-value filters of data columns.
#include "proxies/rows.h"

#include <algorithm>
#include <boost/dynamic_bitset.hpp>
#include <cstddef>
#include <limits>

#include "proxies/column_variable.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {

namespace {

// Marks of the rows of a set, for membership tests in constant time. The
// bitset is doubled to twice a row's number whenever a row lies beyond it.
void markRow(boost::dynamic_bitset<>& marks, int row) {
  if (row < 0) return;
  const auto r = static_cast<std::size_t>(row);
  if (r >= marks.size()) marks.resize(2 * r + 1);
  marks.set(r);
}

bool isMarked(const boost::dynamic_bitset<>& marks, int row) {
  return row >= 0 && static_cast<std::size_t>(row) < marks.size() &&
         marks.test(static_cast<std::size_t>(row));
}

void markAll(boost::dynamic_bitset<>& marks, const CbRows& rows) {
  const int n = rows.mGetRowCt();
  for (int i = 0; i < n; ++i) markRow(marks, rows.mGetRow(i));
}

// Appends a row exactly as given: the compressed form survives only when the
// row is the next whole number.
void appendExactly(CbRows& rows, int row) {
  if (rows.mIsUseAllRows() && row != rows.mGetRowCt() + 1) rows.mConvertFromUseAllRows();
  rows.mPushBack(row);
}

// The length of the shortest column; no column (or only null ones) sets no
// limit.
std::size_t shortestLength(const std::vector<const std::vector<double>*>& columns) {
  std::size_t m = std::numeric_limits<std::size_t>::max();
  for (const auto* column : columns) {
    if (column) m = std::min(m, column->size());
  }
  return m;
}

bool anyMissingAt(const std::vector<const std::vector<double>*>& columns, std::size_t index) {
  for (const auto* column : columns) {
    if (column && mIsNumericMissing((*column)[index])) return true;
  }
  return false;
}

}  // namespace

CbRows::CbRows() : mPendingReserve(0), mUseAll(true), mRowCount(0) {}

CbRows::CbRows(const CbRows& other) = default;

CbRows& CbRows::operator=(const CbRows& other) = default;

CbRows::~CbRows() = default;

CbRows* CbRows::mClone() const {
  return new CbRows(*this);
}

void CbRows::mGetAllRows(std::vector<int>& rows) const {
  if (!mUseAll) {
    rows = mRows;
    return;
  }
  rows.resize(static_cast<std::size_t>(mRowCount));
  for (int i = 0; i < mRowCount; ++i) rows[static_cast<std::size_t>(i)] = i + 1;
}

void CbRows::mGetRowFlags(int /*n*/, std::vector<bool>& flags) const {
  for (int i = 0; i < mRowCount; ++i) flags[static_cast<std::size_t>(mGetRow(i) - 1)] = true;
}

void CbRows::mClear() {
  mUseAllRows(0);
}

void CbRows::mUseAllRows(int n) {
  mUseAll = true;
  mRowCount = n;
  mRows.clear();
}

int CbRows::mInitialize(const std::vector<int>& rows) {
  mRowCount = static_cast<int>(rows.size());
  bool sequence = true;
  for (std::size_t i = 0; i < rows.size() && sequence; ++i) {
    sequence = rows[i] == static_cast<int>(i) + 1;
  }
  mUseAll = sequence;
  if (sequence) {
    mRows.clear();
  } else {
    mRows = rows;
  }
  return mRowCount;
}

void CbRows::mReserve(int n) {
  mPendingReserve = n;
}

void CbRows::mPushBack(int row) {
  ++mRowCount;
  if (!mUseAll) {
    if (mPendingReserve > 0) mRows.reserve(static_cast<std::size_t>(mPendingReserve));
    mPendingReserve = 0;
    mRows.push_back(row);
    return;
  }
  if (row > mRowCount) {
    mConvertFromUseAllRows();
    mRows.back() = row;
  }
}

void CbRows::mSetRow(int i, int row) {
  if (mUseAll) {
    if (row == i + 1) return;
    mConvertFromUseAllRows();
  }
  mRows[static_cast<std::size_t>(i)] = row;
}

void CbRows::mConvertFromUseAllRows() {
  if (!mUseAll) return;
  if (mPendingReserve > mRowCount) mRows.reserve(static_cast<std::size_t>(mPendingReserve));
  mPendingReserve = 0;
  mRows.resize(static_cast<std::size_t>(mRowCount));
  for (int i = 0; i < mRowCount; ++i) mRows[static_cast<std::size_t>(i)] = i + 1;
  mUseAll = false;
}

void CbRows::mSwapRows(int i, int j) {
  if (i == j) return;
  mConvertFromUseAllRows();
  std::swap(mRows[static_cast<std::size_t>(i)], mRows[static_cast<std::size_t>(j)]);
}

void CbRows::mSort() {
  if (!mUseAll) std::sort(mRows.begin(), mRows.end());
}

int CbRows::mAppendRows(const CbRows& other) {
  boost::dynamic_bitset<> present;
  markAll(present, *this);
  int appended = 0;
  const int n = other.mGetRowCt();
  for (int i = 0; i < n; ++i) {
    const int row = other.mGetRow(i);
    if (isMarked(present, row)) continue;
    markRow(present, row);
    appendExactly(*this, row);
    ++appended;
  }
  return appended;
}

int CbRows::mAppendUniqueRows(const CbRows& other) {
  CbRows copy(*this);
  const int n = other.mGetRowCt();
  for (int i = 0; i < n; ++i) appendExactly(copy, other.mGetRow(i));
  *this = copy;
  return n;
}

int CbRows::mFilterRowsExclude(const CbRows& other) {
  return mFilterRowsInternal(other, false);
}

int CbRows::mFilterRowsInclude(const CbRows& other) {
  return mFilterRowsInternal(other, true);
}

int CbRows::mFilterRowsInclude(int maxRow) {
  const int before = mRowCount;
  if (mUseAll) {
    mRowCount = std::min(mRowCount, std::max(maxRow, 0));
    return before - mRowCount;
  }
  mRows.erase(std::remove_if(mRows.begin(), mRows.end(), [maxRow](int r) { return r > maxRow; }),
              mRows.end());
  mRowCount = static_cast<int>(mRows.size());
  return before - mRowCount;
}

int CbRows::mFilterRowsInternal(const CbRows& other, bool include) {
  const int before = mRowCount;
  if (mUseAll && other.mUseAll && include) {
    mRowCount = std::min(mRowCount, other.mRowCount);
    return before - mRowCount;
  }
  boost::dynamic_bitset<> marks;
  if (!other.mUseAll) markAll(marks, other);
  CbRows kept;
  for (int i = 0; i < mRowCount; ++i) {
    const int row = mGetRow(i);
    const bool present =
        other.mUseAll ? (row >= 1 && row <= other.mRowCount) : isMarked(marks, row);
    if (present == include) appendExactly(kept, row);
  }
  kept.mPendingReserve = mPendingReserve;
  *this = kept;
  return before - mRowCount;
}

bool CbRows::operator==(const CbRows& other) const {
  if (mRowCount != other.mRowCount) return false;
  if (mUseAll && other.mUseAll) return true;
  for (int i = 0; i < mRowCount; ++i) {
    if (mGetRow(i) != other.mGetRow(i)) return false;
  }
  return true;
}

CmRows::~CmRows() = default;

CmRows* CmRows::mClone() const {
  return new CmRows(*this);
}

int CmRows::mFilterExcludeMissings(const std::vector<double>* column) {
  return mFilterExcludeMissings(std::vector<const std::vector<double>*>{column});
}

int CmRows::mFilterExcludeMissings(const std::vector<const std::vector<double>*>& columns) {
  const std::size_t m = shortestLength(columns);
  CmRows kept;
  for (int p = 0; p < mRowCount; ++p) {
    const int row = mGetRow(p);
    const auto position = static_cast<std::size_t>(p);
    // A row beyond the data, or a position beyond it (possible only in a
    // list form), has nothing to read and is dropped.
    if (row < 1 || static_cast<std::size_t>(row) > m || position >= m) continue;
    if (!anyMissingAt(columns, position)) appendExactly(kept, row);
  }
  *this = kept;
  return mRowCount;
}

int CmRows::mFilterExcludeMissingVariables(const std::vector<const CmColumnVar<double>*>& columns) {
  std::vector<const std::vector<double>*> data;
  data.reserve(columns.size());
  for (const auto* column : columns) data.push_back(column ? column->mGetDataValues() : nullptr);
  return mFilterExcludeMissings(data);
}

int CmRows::mInitializeWithNonMissings(const std::vector<double>* column) {
  return mInitializeWithNonMissings(std::vector<const std::vector<double>*>{column});
}

int CmRows::mInitializeWithNonMissings(const std::vector<const std::vector<double>*>& columns) {
  mClear();
  std::size_t m = shortestLength(columns);
  if (m == std::numeric_limits<std::size_t>::max()) m = 0;
  m = std::min(m, static_cast<std::size_t>(std::numeric_limits<int>::max()));
  for (std::size_t i = 0; i < m; ++i) {
    if (!anyMissingAt(columns, i)) appendExactly(*this, static_cast<int>(i) + 1);
  }
  return mRowCount;
}

}  // namespace qel
