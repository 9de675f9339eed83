// The position sort against std::stable_sort on index/key tuples, and the
// frequency reader's truncation, totals and zero-row exclusion.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <tuple>
#include <vector>

#include "proxies/Frequencies.h"
#include "proxies/SortTool.h"
#include "utilities/LYNBasicTypes.h"

namespace {

using qel::CbRows;

std::vector<int> rowsOf(const CbRows& r) {
  std::vector<int> v;
  r.mGetAllRows(v);
  return v;
}

// Multi-key sorts (keys applied least significant first, each in its own
// direction) over random data with many ties, all rows or a row subset.
TEST(SortTool, MultiKeyRefineMatchesStableSortModel) {
  std::mt19937 g(7);
  for (int trial = 0; trial < 200; ++trial) {
    const int n = 1 + static_cast<int>(g() % 40);
    std::vector<int> k1(n), rowList;
    std::vector<double> k2(n);
    for (int i = 0; i < n; ++i) {
      k1[i] = static_cast<int>(g() % 4);
      k2[i] = 0.5 * static_cast<double>(g() % 3);
      if (g() % 3) rowList.push_back(i + 1);
    }
    std::shuffle(rowList.begin(), rowList.end(), g);
    const bool subset = trial % 2 == 1;
    CbRows rows;
    if (subset) rows.mInitialize(rowList); else rows.mUseAllRows(n);
    const bool up1 = g() % 2, up2 = g() % 2;

    // Model: a stable sort of positions on the (major, minor) tuple, each
    // key in its own direction; full ties keep position order.
    const int m = rows.mGetRowCt();
    auto keyOf = [&](int pos) {
      const int r = rows.mGetRow(pos) - 1;
      return std::make_tuple(up1 ? k1[r] : -k1[r], up2 ? k2[r] : -k2[r]);
    };
    std::vector<int> expect(m);
    for (int i = 0; i < m; ++i) expect[i] = i;
    std::stable_sort(expect.begin(), expect.end(),
                     [&](int a, int b) { return keyOf(a) < keyOf(b); });
    qel::CmSortTool<double> tool;  // minor key first, then refined by the major
    tool.mSort(k2, rows, true, up2);
    const std::vector<double> k1d(k1.begin(), k1.end());
    tool.mSort(k1d, rows, false, up1);
    ASSERT_EQ(tool.mGetSortedPositions(), expect) << "trial " << trial;

    qel::CmSortTool<int> major;
    major.mSort(k1, rows, true, up1);
    // Single key, stable both ways: ties keep their position order.
    std::vector<int> single(m);
    for (int i = 0; i < m; ++i) single[i] = i;
    std::stable_sort(single.begin(), single.end(), [&](int a, int b) {
      const int ka = k1[rows.mGetRow(a) - 1], kb = k1[rows.mGetRow(b) - 1];
      return up1 ? ka < kb : kb < ka;
    });
    ASSERT_EQ(major.mGetSortedPositions(), single) << "trial " << trial;
  }
}

TEST(SortTool, SortedRowNumbersArePositionsPlusOne) {
  const std::vector<double> data{3.0, 1.0, 2.0, 1.0, 3.0};
  qel::CmSortTool<double> tool;
  CbRows out;
  tool.mSort(data, true, false);
  tool.mGetSortedRowNumbers(out);
  EXPECT_EQ(rowsOf(out), (std::vector<int>{1, 5, 3, 2, 4}));
  tool.mSort(data, true, true);
  tool.mGetSortedRowNumbers(out);
  EXPECT_EQ(rowsOf(out), (std::vector<int>{2, 4, 3, 1, 5}));
  tool.mSort(std::vector<double>{}, true, true);
  tool.mGetSortedRowNumbers(out);
  EXPECT_EQ(out.mGetRowCt(), 0);
}

TEST(Frequencies, TruncationTotalsAndZeroExclusion) {
  const std::vector<double> f{2.9, 0.0, 1.0, qel::mGetMissingValueCode(), 0.4, -1.5, 3.0};
  const std::vector<double> g{1.0, 1.0};
  qel::CmFrequencies freq(std::vector<const std::vector<double>*>{&f, &g});
  const qel::CbFrequencies unit;
  const int expected[] = {2, 0, 1, 0, 0, -1, 3};
  for (int r = 0; r < 7; ++r) EXPECT_EQ(freq.mGetRowFrequency(r, 0), expected[r]) << r;
  EXPECT_EQ(freq.mGetRowFrequency(7, 0), 0);
  EXPECT_EQ(freq.mGetFreqColCt(), 2);
  EXPECT_EQ(freq.mGetFreqRowCt(1), 2);
  EXPECT_EQ(unit.mGetRowFrequency(4, 0), 1);

  CbRows rows;
  rows.mInitialize({7, 2, 1, 5, 3});
  EXPECT_EQ(freq.mGetTotalFrequency(rows, 0), 3 + 0 + 2 + 0 + 1);
  EXPECT_EQ(unit.mGetTotalFrequency(rows, 0), 5);
  EXPECT_EQ(unit.mGetTotalFrequency(CbRows(), 0), 0);
  EXPECT_EQ(freq.mGetTotalFrequency(CbRows(), 0), 0);

  freq.mExcludeRowsWithZeroFreq(rows, 0);
  EXPECT_EQ(rowsOf(rows), (std::vector<int>{7, 1, 3}));
}

}  // namespace
