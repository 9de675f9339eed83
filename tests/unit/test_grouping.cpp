// Groupings against a plain model (value tuples, a stable sort, a map),
// the documented small cases, the 31-bit limit, the merge sort and the
// distinct-value look-ups.
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <map>
#include <random>
#include <vector>

#include "proxies/grouping.h"
#include "utilities/LYNBasicTypes.h"

namespace {

using qel::CbRows;
using Col = qel::CmColumnVar<double>;
using Grouping = qel::CmGrouping<double>;
using Tuple = std::vector<double>;

// Sort key of a value in one column: natural order is the value; first
// encounter is the first index in the given sequence; a list order is the
// list place, values outside the list after it, ascending.
std::pair<double, double> keyOf(double v, int mode, const std::vector<double>& seq,
                                const std::vector<double>& list) {
  if (mode == 0) return {v, 0};
  if (mode == 1) return {double(std::find(seq.begin(), seq.end(), v) - seq.begin()), 0};
  const auto at = std::find(list.begin(), list.end(), v);
  return at == list.end() ? std::make_pair(1e300, v)
                          : std::make_pair(double(at - list.begin()), 0.0);
}

struct Model {
  std::vector<Tuple> values;              // values of each group, in order
  std::vector<std::vector<int>> members;  // row numbers of each group
};

// The expected grouping: stable sort of the rows by the key tuples; compact
// groups are the runs, all-combination groups are numbered by the subscripts
// (distinct values of the row set in key order, first encounter in row order).
Model model(const std::vector<std::vector<double>>& data, const std::vector<int>& modes,
            const std::vector<std::vector<double>>& lists, const std::vector<int>& rows, bool all) {
  const std::size_t nc = data.size();
  std::vector<std::vector<double>> seqs(nc);
  for (std::size_t c = 0; c < nc; ++c)
    for (int r : rows) seqs[c].push_back(data[c][r - 1]);
  auto key = [&](int row, bool wholeColumn, std::size_t c) {
    return keyOf(data[c][row - 1], modes[c], wholeColumn ? data[c] : seqs[c], lists[c]);
  };
  std::vector<int> sorted = rows;
  std::stable_sort(sorted.begin(), sorted.end(), [&](int a, int b) {
    for (std::size_t c = 0; c < nc; ++c) {
      if (key(a, true, c) != key(b, true, c)) return key(a, true, c) < key(b, true, c);
    }
    return false;
  });
  Model m;
  std::map<Tuple, std::size_t> index;
  std::vector<std::vector<double>> distinct(nc);
  for (std::size_t c = 0; c < nc; ++c) {
    std::map<std::pair<double, double>, double> byKey;
    for (int r : rows) byKey.emplace(key(r, false, c), data[c][r - 1]);
    for (auto& e : byKey) distinct[c].push_back(e.second);
  }
  if (all) {
    std::size_t total = 1;
    for (auto& d : distinct) total *= d.size();
    for (std::size_t g = 0; g < total; ++g) {
      Tuple t(nc);
      for (std::size_t c = nc, rest = g; c-- > 0; rest /= distinct[c].size())
        t[c] = distinct[c][rest % distinct[c].size()];
      index[t] = g;
      m.values.push_back(t);
    }
    m.members.resize(total);
  }
  for (int r : sorted) {
    Tuple t(nc);
    for (std::size_t c = 0; c < nc; ++c) t[c] = data[c][r - 1];
    if (!index.count(t)) {
      index[t] = m.values.size();
      m.values.push_back(t);
      m.members.emplace_back();
    }
    m.members[index[t]].push_back(r);
  }
  return m;
}

// Groups, their order, values and members against the model; mGetGroup
// against the indicators on every row.
void checkAgainstModel(const std::vector<std::vector<double>>& data, const std::vector<int>& modes,
                       const std::vector<std::vector<double>>& lists, const std::vector<Col>& cols,
                       const std::vector<int>& rows, int order, bool all, int trial) {
  std::vector<const Col*> ptrs;
  for (const Col& c : cols) ptrs.push_back(&c);
  CbRows set;
  set.mInitialize(rows);
  Grouping grouping;
  if (order == 0) grouping.mUseNaturalOrder();
  if (order == 1) grouping.mUseFirstEncounteredOrder();
  ASSERT_EQ(grouping.mFindGrouping(ptrs, set, false, all, true), 0);
  const Model m = model(data, modes, lists, rows, all);
  ASSERT_EQ(grouping.mGetNumberOfGroups(), int(m.values.size())) << trial;
  std::vector<int> indicators, members;
  grouping.mGetGroupIndicators(indicators);
  for (int gr = 0; gr < grouping.mGetNumberOfGroups(); ++gr) {
    Tuple values;
    grouping.mGetValues(gr, values);
    grouping.mGetRowsInGroup(gr, members);
    EXPECT_EQ(values, m.values[gr]) << trial << " group " << gr;
    EXPECT_EQ(members, m.members[gr]) << trial << " group " << gr;
  }
  for (int r : rows) {
    const int gr = grouping.mGetGroup(r);
    ASSERT_EQ(gr, indicators[r - 1]) << trial << " row " << r;
    ASSERT_GE(gr, 0);
    EXPECT_EQ(m.members[gr].size(),
              std::size_t(std::count(indicators.begin(), indicators.end(), gr)));
  }
  CbRows recovered;
  grouping.mRecoverRowsToUse(recovered);
  ASSERT_EQ(recovered.mGetRowCt(), int(rows.size()));
}

TEST(Grouping, AgreesWithPlainModelOnRandomColumns) {
  std::mt19937 g(25);
  const double missing = qel::mGetMissingValueCode();
  for (int trial = 0; trial < 400; ++trial) {
    const int n = 1 + int(g() % 30), nc = 1 + trial % 3, order = (trial / 3) % 3;
    const bool all = trial % 2 == 1;
    std::vector<std::vector<double>> data(nc, std::vector<double>(n)), lists(nc);
    std::vector<int> modes(nc);
    std::vector<Col> cols(nc);
    for (int c = 0; c < nc; ++c) {
      const int k = 1 + int(g() % 5);
      for (auto& v : data[c]) v = g() % 9 == 0 ? missing : 0.5 * double(g() % k) - 1;
      for (int i = 0; i < 3; ++i) lists[c].push_back(0.5 * double(g() % 7) - 1);
      std::sort(lists[c].begin(), lists[c].end());
      lists[c].erase(std::unique(lists[c].begin(), lists[c].end()), lists[c].end());
      std::shuffle(lists[c].begin(), lists[c].end(), g);
      modes[c] = order == 0 ? 0 : order == 1 ? 1 : int(g() % 3);
      cols[c] = Col(&data[c], qel::EDefinedSortOrder(modes[c]));
      if (modes[c] == 2) cols[c].mSetSortOrder(&lists[c]);
    }
    std::vector<int> rows;
    const int kind = trial % 4;  // all rows, compressed prefix, ascending, shuffled subset
    for (int r = 1; r <= n; ++r)
      if (kind < 2 ? (kind == 0 || r <= (n + 1) / 2) : g() % 3 != 0) rows.push_back(r);
    if (kind == 3) std::shuffle(rows.begin(), rows.end(), g);
    checkAgainstModel(data, modes, lists, cols, rows, order, all, trial);
  }
}

// Many distinct values: the combined places exceed the counting range (two
// columns) or 64 bits (six columns), so the other sort paths run.
TEST(Grouping, ManyDistinctValuesAgreeWithPlainModel) {
  std::mt19937 g(26);
  for (const int nc : {2, 6}) {
    const int n = 3000;
    std::vector<std::vector<double>> data(nc, std::vector<double>(n)), lists(nc);
    std::vector<Col> cols;
    for (int c = 0; c < nc; ++c) {
      for (auto& v : data[c]) v = double(g() % (c == 0 && nc == 2 ? 50 : 3000));
      cols.emplace_back(&data[c], qel::eNaturalSortOrder);
    }
    std::vector<int> rows(n);
    for (int r = 0; r < n; ++r) rows[r] = n - r;
    checkAgainstModel(data, std::vector<int>(nc, 0), lists, cols, rows, 0, false, nc);
  }
}

std::vector<Tuple> groupValues(const std::vector<double>& a, const std::vector<double>* b,
                               int order, const std::vector<double>* list, bool all) {
  Col ca(&a, qel::EDefinedSortOrder(order)), cb(b, qel::eNaturalSortOrder);
  if (list != nullptr) ca.mSetSortOrder(list);
  std::vector<const Col*> cols{&ca};
  if (b != nullptr) cols.push_back(&cb);
  Grouping grouping;
  EXPECT_EQ(grouping.mFindGrouping(cols, false, all, true), 0);
  std::vector<Tuple> out(grouping.mGetNumberOfGroups());
  for (int i = 0; i < grouping.mGetNumberOfGroups(); ++i) grouping.mGetValues(i, out[i]);
  return out;
}

TEST(Grouping, DocumentedSmallCases) {
  const double missing = qel::mGetMissingValueCode();
  // The random model uses halves only: values a hair apart stay apart.
  EXPECT_EQ(groupValues({missing, 2, 1.0000000001, 1}, nullptr, 0, nullptr, false),
            (std::vector<Tuple>{{1}, {1.0000000001}, {2}, {missing}}));
  const std::vector<double> a{2, 1, 2}, b{5, 6, 7};
  Col ca(&a, qel::eNaturalSortOrder), cb(&b, qel::eNaturalSortOrder);
  Grouping grouping;
  ASSERT_EQ(grouping.mFindGrouping({&ca, &cb}, false, true, true), 0);
  EXPECT_EQ(grouping.mGetGroupSize(0), 0);  // (1, 5) does not occur
  EXPECT_EQ(grouping.mGetGroupSize(3), 1);  // (2, 5) is row 1
  EXPECT_EQ(grouping.mGetGroup(2), 1);
  // NaN cells form one group, after every number; look-ups still agree.
  const std::vector<double> withNaN{NAN, 2, NAN, 1};
  Col cn(&withNaN, qel::eNaturalSortOrder);
  ASSERT_EQ(grouping.mFindGrouping(&cn, false, false, true), 0);
  ASSERT_EQ(grouping.mGetNumberOfGroups(), 3);
  EXPECT_EQ(grouping.mGetGroupSize(2), 2);
  EXPECT_EQ(grouping.mGetGroup(3), 2);
  EXPECT_EQ(grouping.mGetGroup(4), 0);
  // No rows: no groups.
  CbRows none;
  EXPECT_EQ(grouping.mFindGrouping(&ca, none, false, true, true), 0);
  EXPECT_EQ(grouping.mGetNumberOfGroups(), 0);
  EXPECT_EQ(grouping.mGetGroup(1), -1);
}

TEST(Grouping, AllCombinationsBeyond31BitsFailFast) {
  std::vector<double> a(65536), b(65536);
  for (int i = 0; i < 65536; ++i) a[i] = b[65535 - i] = i;
  Col ca(&a, qel::eNaturalSortOrder), cb(&b, qel::eNaturalSortOrder);
  Grouping grouping;
  const auto start = std::chrono::steady_clock::now();
  EXPECT_EQ(grouping.mFindGrouping({&ca, &cb}, false, true, true), 30023);
  EXPECT_LT(std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count(), 2.0);
  EXPECT_EQ(grouping.mGetNumberOfGroups(), 0);
  EXPECT_EQ(grouping.mFindGrouping({&ca, &cb}, false, false, true), 0);
  EXPECT_EQ(grouping.mGetNumberOfGroups(), 65536);
}

TEST(Grouping, MergeSortIsStableInBothDirections) {
  std::mt19937 g(5);
  for (int n = 0; n <= 70; ++n) {
    std::vector<double> k1(n), k2(n);
    for (int i = 0; i < n; ++i) k1[i] = double(g() % 3), k2[i] = double(g() % 4);
    if (n > 3) k2[n / 2] = NAN;
    std::vector<int> index(n), expected(n);
    for (int i = 0; i < n; ++i) index[i] = expected[i] = i;
    qel::mMergeSort(index, qel::CmSortCompare<double>({k1.data(), k2.data()}, {false, true}));
    // A NaN key never orders, so the check compares only k1 where k2 is NaN.
    for (int i = 1; i < n; ++i) {
      const int a = index[i - 1], b = index[i];
      ASSERT_GE(k1[a], k1[b]) << n;
      if (k1[a] == k1[b] && !std::isnan(k2[a]) && !std::isnan(k2[b])) {
        ASSERT_LE(k2[a], k2[b]) << n;
        if (k2[a] == k2[b]) { ASSERT_LT(a, b) << n; }
      }
    }
    std::sort(index.begin(), index.end());
    ASSERT_EQ(index, expected);
  }
}

// The index sort on columns: list order on the first column (values outside
// the list after it, ascending), natural on the second, ties in index order.
TEST(Grouping, IndexedSortByColumnsMatchesStableSortModel) {
  std::mt19937 g(12);
  const std::vector<double> list{2, 0};
  for (int n = 0; n < 60; ++n) {
    std::vector<double> a(n), b(n);
    for (int i = 0; i < n; ++i) a[i] = double(g() % 4), b[i] = double(g() % 3);
    Col ca(&a, qel::eNaturalSortOrder), cb(&b, qel::eNaturalSortOrder);
    ca.mSetSortOrder(&list);
    std::vector<int> index(n), expected(n);
    for (int i = 0; i < n; ++i) index[i] = expected[i] = i;
    qel::mIndexedSortByCols({&ca, &cb}, index, {true, true}, false, false);
    std::stable_sort(expected.begin(), expected.end(), [&](int i, int j) {
      return std::make_pair(keyOf(a[i], 2, a, list), b[i]) <
             std::make_pair(keyOf(a[j], 2, a, list), b[j]);
    });
    ASSERT_EQ(index, expected) << n;
  }
}

TEST(DistinctValues, SubscriptsLookUpsAndCopies) {
  const std::vector<double> data{5, 2, 5, 9, 2, 7};
  const std::vector<double> list{9, 4, 5};
  Col col(&data, qel::eFirstEncounteredSortOrder);
  qel::CmDistinctValues<double> dv;
  dv.mFindDistinctValues(&col, std::vector<int>{4, 2, 1});
  EXPECT_EQ(dv.mGetDistinctValueCt(), 3);
  EXPECT_EQ(dv.mGetSubscript(9.0), 0);
  EXPECT_EQ(dv.mGetSubscript(1), 2);  // row 1 holds 5
  EXPECT_EQ(dv.mFindSubscript(7.0), int(qel::mGetMaxInteger()));
  EXPECT_EQ(dv.mGetDistinctDataValue(3), qel::mGetMissingValueCode());
  col.mSetSortOrder(&list);
  qel::CmDistinctValues<double> listed;
  listed.mFindDistinctValues(&col);
  std::vector<double> values;
  listed.mGetDistinctValues(values);
  EXPECT_EQ(values, (std::vector<double>{9, 5, 2, 7}));  // 4 is absent and skipped
  qel::CmDistinctValues<double> copy = listed, natural;
  EXPECT_TRUE(copy.mEqual(listed));
  natural.mUseNaturalOrder();
  natural.mFindDistinctValues(&col);
  EXPECT_FALSE(natural.mEqual(listed));
  CbRows none;
  natural.mFindDistinctValues(&col, none);
  EXPECT_EQ(natural.mGetDistinctValueCt(), 0);
  std::vector<unsigned long long> ids;
  CbRows rows;
  rows.mUseAllRows(6);
  listed.mUpdateGroupID(ids, rows);
  listed.mUpdateGroupID(ids, rows);
  EXPECT_EQ(ids, (std::vector<unsigned long long>{5, 10, 5, 0, 10, 15}));
}

TEST(Rows, FilterExcludeMissingsOnColumnVariables) {
  const double m = qel::mGetMissingValueCode();
  const std::vector<double> a{1, m, 3, 4}, b{1, 2, m};
  Col ca(&a, qel::eNaturalSortOrder), cb(&b, qel::eNaturalSortOrder);
  qel::CmRows rows;
  rows.mUseAllRows(4);
  EXPECT_EQ(rows.mFilterExcludeMissings(std::vector<const Col*>{&ca, &cb}), 1);
  EXPECT_EQ(rows.mGetRow(0), 1);
}

}  // namespace
