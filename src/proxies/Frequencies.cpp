// Row frequencies: the unit base and the frequency-column reader.
#include "proxies/Frequencies.h"

#include <cmath>
#include <cstddef>
#include <limits>

namespace qel {

CbFrequencies::~CbFrequencies() = default;

int CbFrequencies::mGetRowFrequency(int /*row*/, int /*column*/) const {
  return 1;
}

int CbFrequencies::mGetTotalFrequency(const CbRows& rows, int /*column*/) const {
  return rows.mGetRowCt();
}

CmFrequencies::CmFrequencies(const std::vector<double>* column) : mColumns{column} {}

CmFrequencies::CmFrequencies(const std::vector<const std::vector<double>*>& columns)
    : mColumns(columns) {}

CmFrequencies::~CmFrequencies() = default;

const std::vector<double>* CmFrequencies::mGetFrequencyCol(int column) const {
  if (column < 0 || static_cast<std::size_t>(column) >= mColumns.size()) return nullptr;
  return mColumns[static_cast<std::size_t>(column)];
}

int CmFrequencies::mGetFreqColCt() const {
  return static_cast<int>(mColumns.size());
}

int CmFrequencies::mGetFreqRowCt(int column) const {
  const std::vector<double>* col = mGetFrequencyCol(column);
  return col ? static_cast<int>(col->size()) : 0;
}

int CmFrequencies::mGetRowFrequency(int row, int column) const {
  const std::vector<double>* col = mGetFrequencyCol(column);
  if (!col || row < 0 || static_cast<std::size_t>(row) >= col->size()) return 0;
  const double v = (*col)[static_cast<std::size_t>(row)];
  // NaN fails both comparisons; the missing value lies beyond the int range.
  if (!(v > -2147483649.0 && v < 2147483648.0)) return 0;
  return static_cast<int>(v);
}

int CmFrequencies::mGetTotalFrequency(const CbRows& rows, int column) const {
  int total = 0;
  const int n = rows.mGetRowCt();
  for (int i = 0; i < n; ++i) total += mGetRowFrequency(rows.mGetRow(i) - 1, column);
  return total;
}

void CmFrequencies::mExcludeRowsWithZeroFreq(CbRows& rows, int column) const {
  std::vector<int> zeroRows;
  const int n = rows.mGetRowCt();
  for (int i = 0; i < n; ++i) {
    const int row = rows.mGetRow(i);
    if (mGetRowFrequency(row - 1, column) == 0) zeroRows.push_back(row);
  }
  if (zeroRows.empty()) return;
  CbRows zero;
  zero.mInitialize(zeroRows);
  rows.mFilterRowsExclude(zero);
}

}  // namespace qel
