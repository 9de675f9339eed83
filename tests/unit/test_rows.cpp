// Row sets against a plain vector model under random operation sequences,
// and the documented cases of the compressed form.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <vector>

#include "proxies/rows.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"

namespace {

using qel::CbRows;
using qel::CmRows;

std::vector<int> rowsOf(const CbRows& r) {
  std::vector<int> v;
  r.mGetAllRows(v);
  return v;
}

bool contains(const std::vector<int>& v, int x) {
  return std::find(v.begin(), v.end(), x) != v.end();
}

// A random other set: all rows 1..k, or k distinct rows in random order.
CbRows randomOther(std::mt19937& g, std::vector<int>& model) {
  CbRows other;
  const int k = static_cast<int>(g() % 12);
  model.clear();
  if (g() % 2) {
    other.mUseAllRows(k);
    for (int i = 1; i <= k; ++i) model.push_back(i);
  } else {
    for (int i = 0; i < k; ++i) {
      const int r = 1 + static_cast<int>(g() % 30);
      if (!contains(model, r)) model.push_back(r);
    }
    other.mInitialize(model);
  }
  return other;
}

TEST(Rows, RandomOperationsMatchVectorModel) {
  std::mt19937 g(20261123);
  CbRows rows;
  std::vector<int> model;
  for (int step = 0; step < 20000; ++step) {
    std::vector<int> otherModel;
    const int n = static_cast<int>(model.size());
    const int op = static_cast<int>(g() % 11);
    if (op == 0) {
      // A compressed set keeps reading 1 .. count for a row at or below the
      // new count.
      const int r = 1 + static_cast<int>(g() % 40);
      const bool kept = !rows.mIsUseAllRows() || r > n + 1;
      rows.mPushBack(r);
      model.push_back(kept ? r : n + 1);
    } else if (op == 1 && n > 0) {
      const int i = static_cast<int>(g() % n), r = 1 + static_cast<int>(g() % 40);
      rows.mSetRow(i, r);
      model[i] = r;
    } else if (op == 2 && n > 0) {
      const int i = static_cast<int>(g() % n), j = static_cast<int>(g() % n);
      rows.mSwapRows(i, j);
      std::swap(model[i], model[j]);
    } else if (op == 3) {
      rows.mSort();
      std::sort(model.begin(), model.end());
    } else if (op == 4) {
      const CbRows other = randomOther(g, otherModel);
      int added = 0;
      for (int r : otherModel) {
        if (!contains(model, r)) model.push_back(r), ++added;
      }
      EXPECT_EQ(rows.mAppendRows(other), added);
    } else if (op == 5) {
      const CbRows other = randomOther(g, otherModel);
      model.insert(model.end(), otherModel.begin(), otherModel.end());
      EXPECT_EQ(rows.mAppendUniqueRows(other), static_cast<int>(otherModel.size()));
    } else if (op == 6 || op == 7) {
      const CbRows other = randomOther(g, otherModel);
      const bool include = op == 7;
      std::vector<int> kept;
      for (int r : model) {
        if (contains(otherModel, r) == include) kept.push_back(r);
      }
      const int removed = include ? rows.mFilterRowsInclude(other) : rows.mFilterRowsExclude(other);
      EXPECT_EQ(removed, n - static_cast<int>(kept.size()));
      model = kept;
    } else if (op == 8) {
      const int maxRow = static_cast<int>(g() % 30);
      model.erase(std::remove_if(model.begin(), model.end(), [&](int r) { return r > maxRow; }),
                  model.end());
      EXPECT_EQ(rows.mFilterRowsInclude(maxRow), n - static_cast<int>(model.size()));
    } else if (op == 9 && g() % 8 == 0) {
      const int k = static_cast<int>(g() % 10);
      rows.mUseAllRows(k);
      model.clear();
      for (int i = 1; i <= k; ++i) model.push_back(i);
    } else if (op == 10 && g() % 4 == 0) {
      randomOther(g, model);
      EXPECT_EQ(rows.mInitialize(model), static_cast<int>(model.size()));
    }
    ASSERT_EQ(rows.mGetRowCt(), static_cast<int>(model.size())) << "step " << step;
    ASSERT_EQ(rowsOf(rows), model) << "step " << step << " op " << op;
    for (int i = 0; i < rows.mGetRowCt(); ++i) ASSERT_EQ(rows.mGetRow(i), model[i]);
    CbRows rebuilt;
    rebuilt.mInitialize(model);
    ASSERT_TRUE(rows == rebuilt);
    std::unique_ptr<CbRows> clone(rows.mClone());
    ASSERT_TRUE(*clone == rows);
  }
}

// The compressed flag itself (contents after every operation are the model
// test's): which sets take the compressed form, and equality across forms.
TEST(Rows, CompressedFormCases) {
  CbRows r;
  r.mInitialize({1, 2, 3});
  EXPECT_TRUE(r.mIsUseAllRows());
  r.mInitialize({1, 3});
  EXPECT_FALSE(r.mIsUseAllRows());
  r.mUseAllRows(5);
  r.mSetRow(2, 3);
  EXPECT_TRUE(r.mIsUseAllRows());

  CbRows ascending;
  for (int i = 1; i <= 3; ++i) ascending.mPushBack(i);
  EXPECT_TRUE(ascending.mIsUseAllRows());

  CbRows list, three;
  three.mUseAllRows(3);
  list.mInitialize({1, 2, 4});
  list.mSetRow(2, 3);
  EXPECT_TRUE(list == three);
  EXPECT_FALSE(list.mIsUseAllRows());

  CbRows twoFive;
  twoFive.mInitialize({2, 5});
  std::vector<bool> flags(6, false);
  twoFive.mGetRowFlags(6, flags);
  EXPECT_EQ(flags, (std::vector<bool>{false, true, false, false, true, false}));
}

TEST(Rows, MissingValueFilters) {
  const double m = qel::mGetMissingValueCode();
  const std::vector<double> x = {1.0, m, 3.0, 4.0, 5.0};
  const std::vector<double> y = {1.0, 2.0, 3.0, m};
  CmRows r;
  r.mUseAllRows(6);
  EXPECT_EQ(r.mFilterExcludeMissings({&x, &y}), 2);  // rows 5, 6 beyond y; 2 and 4 missing
  EXPECT_EQ(rowsOf(r), (std::vector<int>{1, 3}));
  CmRows s;
  EXPECT_EQ(s.mInitializeWithNonMissings(&x), 4);
  EXPECT_EQ(rowsOf(s), (std::vector<int>{1, 3, 4, 5}));
  CmRows t;
  t.mUseAllRows(5);
  EXPECT_EQ(t.mFilterExcludeMissings(&x), 4);
  EXPECT_TRUE(t == s);
  // A list is tested at each row's position, not at row - 1.
  CmRows u;
  u.mInitialize({3, 1});
  EXPECT_EQ(u.mFilterExcludeMissings(&x), 1);
  EXPECT_EQ(rowsOf(u), std::vector<int>{3});
}

TEST(Rows, RangesAndVectorHelpers) {
  const double m = qel::mGetMissingValueCode();
  const std::vector<double> x = {4.0, m, -2.5, 9.0, 1.0};
  double lo = 0.0, hi = 0.0;
  qel::mMinMax(x.data(), 5, &lo, &hi);
  EXPECT_EQ(lo, -2.5);
  EXPECT_EQ(hi, 9.0);
  CbRows r;
  r.mInitialize({5, 2, 1});
  qel::mMinMax(x, r, &lo, &hi);
  EXPECT_EQ(lo, 1.0);
  EXPECT_EQ(hi, 4.0);
  r.mInitialize({2});
  qel::mMinMax(x.data(), r, &lo, &hi);
  EXPECT_TRUE(qel::mIsNumericMissing(lo) && qel::mIsNumericMissing(hi));

  std::vector<double> out = {7.0};
  EXPECT_EQ(qel::mHadamardProduct({1.0, 2.0, 3.0}, {4.0, 5.0}, out), 2);
  EXPECT_EQ(out, (std::vector<double>{4.0, 10.0}));
  EXPECT_EQ(qel::mLogVector({std::exp(2.0), 0.0, -1.0}, out), 3);
  EXPECT_NEAR(out[0], 2.0, 1e-15);
  EXPECT_EQ(out[1], 0.0);
  EXPECT_EQ(out[2], 0.0);
  qel::mExponentiateVector({0.0, 1.0}, out);
  EXPECT_EQ(out[0], 1.0);
  EXPECT_NEAR(out[1], std::exp(1.0), 1e-15);
  EXPECT_EQ(qel::mGetINTGVectorIntersection({5, 1, 7, 1}, {1, 7, 9}), (std::vector<int>{1, 7, 1}));
}

}  // namespace
