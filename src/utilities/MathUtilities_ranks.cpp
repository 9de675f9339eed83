// Ranks of a column over a row selection, with ties averaged or broken by
// row order, in either direction, and the re-ranking that leaves missing
// values out.
#include <cmath>
#include <cstddef>
#include <vector>

#include "proxies/SortTool.h"
#include "proxies/rows.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"

namespace qel {

namespace {

std::size_t at(int i) {
  return static_cast<std::size_t>(i);
}

// The selected rows that can be ranked: inside the column and not NaN (no
// order places a NaN; the missing value 1.23456e30 is a number and stays).
CbRows rankableRows(const std::vector<double>& values, const CbRows& rows) {
  const auto length = static_cast<long long>(values.size());
  CbRows kept;
  kept.mReserve(rows.mGetRowCt());
  for (int i = 0; i < rows.mGetRowCt(); ++i) {
    const int row = rows.mGetRow(i);
    if (row < 1 || row > length || std::isnan(values[at(row - 1)])) continue;
    if (kept.mIsUseAllRows() && row != kept.mGetRowCt() + 1) kept.mConvertFromUseAllRows();
    kept.mPushBack(row);
  }
  return kept;
}

}  // namespace

void mComputeRanks(const std::vector<double>& values, const CbRows& rows, std::vector<double>& out,
                   CbRows& outRows, bool averageTies, bool ascending) {
  out.assign(values.size(), mGetMissingValueCode());
  const CbRows ranked = rankableRows(values, rows);
  const int count = ranked.mGetRowCt();
  CmSortTool<double> tool;
  tool.mSort(values, ranked, true, true);
  const std::vector<int>& sorted = tool.mGetSortedPositions();
  outRows.mClear();
  outRows.mReserve(count);
  for (int i = 0; i < count; ++i) {
    const int row = ranked.mGetRow(sorted[at(i)]);
    if (outRows.mIsUseAllRows() && row != outRows.mGetRowCt() + 1) outRows.mConvertFromUseAllRows();
    outRows.mPushBack(row);
  }
  int i = 0;
  while (i < count) {
    int j = i + 1;
    const double value = values[at(outRows.mGetRow(i) - 1)];
    if (averageTies) {
      while (j < count && values[at(outRows.mGetRow(j) - 1)] == value) ++j;
    }
    // Positions i .. j - 1 share the mean of the ranks i + 1 .. j.
    const double rank = 0.5 * (static_cast<double>(i) + static_cast<double>(j) + 1.0);
    for (int k = i; k < j; ++k)
      out[at(outRows.mGetRow(k) - 1)] = ascending ? rank : static_cast<double>(count) + 1.0 - rank;
    i = j;
  }
}

void mComputeRanks(const std::vector<double>& values, std::vector<double>& out, CbRows& outRows,
                   bool averageTies, bool ascending) {
  CbRows rows;
  rows.mUseAllRows(static_cast<int>(values.size()));
  mComputeRanks(values, rows, out, outRows, averageTies, ascending);
}

void mComputeRanks(const std::vector<double>& values, const CbRows& rows, std::vector<double>& out,
                   bool averageTies, bool ascending) {
  CbRows outRows;
  mComputeRanks(values, rows, out, outRows, averageTies, ascending);
}

void mComputeRanks(const std::vector<double>& values, std::vector<double>& out, bool averageTies,
                   bool ascending) {
  CbRows outRows;
  mComputeRanks(values, out, outRows, averageTies, ascending);
}

void mAdjustRanksForMisingValues(const std::vector<double>& values, const CbRows& sortedRows,
                                 std::vector<double>& ranks) {
  const int count = sortedRows.mGetRowCt();
  if (count == 0) return;
  // Groups are walked from the smallest rank up, so that descending ranks
  // (which fall along the ascending sorted rows) stay descending.
  const bool rising =
      ranks[at(sortedRows.mGetRow(0) - 1)] <= ranks[at(sortedRows.mGetRow(count - 1) - 1)];
  auto rowAt = [&](int k) { return sortedRows.mGetRow(rising ? k : count - 1 - k); };
  int before = 0;  // non-missing rows in the groups walked so far
  int i = 0;
  while (i < count) {
    const double rank = ranks[at(rowAt(i) - 1)];
    int j = i;
    int present = 0;
    for (; j < count && ranks[at(rowAt(j) - 1)] == rank; ++j) {
      if (!mIsNumericMissing(values[at(rowAt(j) - 1)])) ++present;
    }
    const double shared = 0.5 * (2.0 * before + present + 1.0);
    for (int k = i; k < j; ++k) {
      const int row = rowAt(k);
      ranks[at(row - 1)] = mIsNumericMissing(values[at(row - 1)]) ? mGetMissingValueCode() : shared;
    }
    before += present;
    i = j;
  }
}

}  // namespace qel
