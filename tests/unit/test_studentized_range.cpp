// The studentized range against mpmath double integrals
// (tools/reference/gen_studentized_range.py, gen_studentized_grid.py) and R's ptukey
// (tools/reference/studentized_range_r.R), its table, rules and edges.
#include <gtest/gtest.h>

#include <cfenv>
#include <cmath>

#include "qel/distributions.h"
#include "reference_data.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/normal_range.h"
#include "utilities/distributions/studentized_range.h"

namespace {

using qeltest::relativeError;

TEST(StudentizedRange, UpperTailMatchesMpmath) {
  const auto rows = qeltest::loadReferenceData("studentized_range_mp.csv", 0);
  ASSERT_EQ(rows.size(), 10u);
  for (const auto& row : rows) {
    const auto& v = row.numbers;
    EXPECT_LE(relativeError(qel::mStudentizedRangePValue(v[2], int(v[0]), v[1]), v[3]), 1e-9)
        << row.line;
  }
}

// The grid k = 2..100, df = 1..1000 (10.5 and 241 off the integers), P = 0.5
// to 0.001, each row an exact (q, P) pair to 25 digits
// (tools/reference/gen_studentized_grid.py): 1e-9 absolute and 1e-7 relative.
TEST(StudentizedRange, UpperTailOnMpmathGrid) {
  const auto rows = qeltest::loadReferenceData("studentized_range_grid_mp.csv", 0);
  ASSERT_EQ(rows.size(), 420u);
  for (const auto& row : rows) {
    const auto& v = row.numbers;
    const double p = qel::GetStudentizedRangePValue(v[2], int(v[0]), v[1]);
    EXPECT_LE(std::fabs(p - v[3]), 1e-9) << row.line;
    EXPECT_LE(relativeError(p, v[3]), 1e-7) << row.line;
  }
}

// R's ptukey holds about 1e-8 from df = 10 on down to P = 0.01 (in the far
// tail at df = 2 to 5 it is off by up to a factor of 3 against mpmath and
// the exact k = 2 law, so those rows are not compared).
TEST(StudentizedRange, UpperTailMatchesPtukey) {
  for (const auto& row : qeltest::loadReferenceData("studentized_range_r.csv", 0)) {
    const auto& v = row.numbers;
    const int k = int(v[0]);
    if ((k != 3 && k != 10) || (v[1] != 10.5 && v[1] != 60 && v[1] != 241)) continue;
    const double tol = v[3] < 0.005 ? 1e-6 : 1e-8;
    EXPECT_LE(relativeError(qel::mStudentizedRangePValue(v[2], k, v[1]), v[3]), tol) << row.line;
  }
}

// At df = 1e12 the chi factor is a spike of width 1e-6 at s = 1 (its log
// density by Stirling's series): the law is the normal range to 1e-11.
TEST(StudentizedRange, LargeDfIsNormalRange) {
  for (int k : {3, 100})
    for (double q : {3.0, 6.0, 9.0})
      EXPECT_LE(
          relativeError(qel::mStudentizedRangePValue(q, k, 1e12), qel::mNormalRangeCdf(q, k, true)),
          1e-9)
          << k << " " << q;
}

TEST(StudentizedRange, CriticalValues) {
  // k = 2: sqrt(2) times the t quantile, unrounded.
  EXPECT_LE(relativeError(qel::mStudentizedRangeCritValue(0.05, 2, 10.0),
                          std::sqrt(2.0) * qel::mTInvCdf(0.975, 10.0, 0.0)),
            1e-14);
  // The table: the published 5 percent points (Harter 1960) at its corners.
  const double table[][3] = {{1, 3, 26.98}, {1, 10, 49.07}, {10, 3, 3.88}, {60, 10, 4.65}};
  for (const auto& t : table) {
    double q = 0;
    EXPECT_TRUE(qel::mTukeyTable(t[0], int(t[1]), 0.05, &q));
    EXPECT_EQ(q, t[2]);
    EXPECT_EQ(qel::GetStudentizedRangeCritValue(0.05, int(t[1]), t[0]), t[2]);
  }
  // The search (alpha off 0.05 by 1e-11) rounds to the table, from R's
  // roots, across it.
  for (int df : {1, 2, 7, 33, 60})
    for (int k : {3, 6, 10}) {
      double q = 0;
      qel::mTukeyTable(df, k, 0.05, &q);
      EXPECT_EQ(qel::mStudentizedRangeCritValue(0.05 + 1e-11, k, df), q) << df << " " << k;
    }
  double q = 0;
  EXPECT_FALSE(qel::mTukeyTable(10.5, 3, 0.05, &q) || qel::mTukeyTable(61, 3, 0.05, &q) ||
               qel::mTukeyTable(10, 11, 0.05, &q) || qel::mTukeyTable(10, 3, 0.05 + 1e-11, &q));
  // The search: the root of the R reference tail, rounded to two decimals
  // (rows away from a rounding border).
  for (const auto& row : qeltest::loadReferenceData("studentized_range_r.csv", 0)) {
    const auto& v = row.numbers;
    const int k = int(v[0]);
    // Rows where ptukey holds 1e-8: df >= 10 at P >= 0.01, k <= 20.
    if (k < 3 || k > 20 || v[1] < 10 || v[3] > 0.1 || v[3] < 0.01) continue;
    const double scaled = 100 * v[2];
    if (std::fabs(scaled - std::floor(scaled) - 0.5) < 0.02) continue;
    EXPECT_EQ(qel::mStudentizedRangeCritValue(v[3], k, v[1]), std::round(scaled) / 100) << row.line;
  }
}

TEST(StudentizedRange, PossibleRules) {
  // k, df, alpha, possible
  const double range[][4] = {{2, 1, 0.001, 1},   {3, 2, 0.05, 1},     {3, 2, 0.01, 0},
                             {41, 20, 0.005, 0}, {11, 2, 0.05, 0},    {40, 5, 0.05, 0},
                             {40, 5.5, 0.05, 1}, {14, 10, 0.005, 1},  {15, 10, 0.005, 0},
                             {40, 11, 0.005, 1}, {41, 11, 0.0099, 0}, {41, 11, 0.01, 1}};
  for (const auto& r : range)
    EXPECT_EQ(qel::IsStudentizedRangePossible(int(r[0]), r[1], r[2]), r[3] != 0)
        << r[0] << " " << r[1];
  EXPECT_TRUE(qel::IsStudentizedMaximumPossible(1, 1.0, 0.001));
  EXPECT_FALSE(qel::IsStudentizedMaximumPossible(3, 2.0, 0.05));
  EXPECT_FALSE(qel::IsStudentizedMaximumModulusPossible(40, 5.0, 0.05));
  EXPECT_FALSE(qel::IsStudentizedMaximumModulusPossible(20, 10.0, 0.001));
  EXPECT_TRUE(qel::IsStudentizedMaximumModulusPossible(20, 10.0, 0.01));
}

TEST(StudentizedRange, BadInputAndState) {
  const double missing = qel::mGetMissingValueCode();
  const double nan = std::nan("");
  const double bad[][3] = {
      {3.0, 1, 10.0}, {3.0, 3, 0.0}, {3.0, 3, -1.0}, {nan, 3, 10.0}, {3.0, 3, nan}};
  for (const auto& b : bad) {
    EXPECT_EQ(qel::GetStudentizedRangePValue(b[0], int(b[1]), b[2]), missing);
    EXPECT_EQ(fegetexcept(), 0);
  }
  for (double alpha : {0.0, 1.0, -0.5, nan}) {
    EXPECT_EQ(qel::GetStudentizedRangeCritValue(alpha, 3, 10.0), missing);
  }
  EXPECT_EQ(qel::GetStudentizedRangePValue(0.0, 3, 10.0), 1.0);
  EXPECT_EQ(qel::GetStudentizedRangePValue(INFINITY, 3, 10.0), 0.0);
  // Far range, df = 1 (s = |Z|): P(Q > q) -> E[R_3] 2 phi(0) / q, E[R_3] = 3/sqrt(pi),
  // down to the edge of the double range.
  for (double q : {1e12, 1e300})
    EXPECT_LE(relativeError(qel::GetStudentizedRangePValue(q, 3, 1.0),
                            3.0 / std::sqrt(M_PI) * std::sqrt(2.0 / M_PI) / q),
              1e-12);
  EXPECT_EQ(qel::mNormalRangeCdf(1e12, 3, true), 0.0);
  EXPECT_EQ(fegetexcept(), 0);
  // The exported normal range: NaN where the kernel has no answer.
  EXPECT_TRUE(std::isnan(qel::v0::NormalRangeCdf(1.0, 1, false)) &&
              std::isnan(qel::v0::NormalRangeCdf(nan, 3, true)) &&
              std::isnan(qel::v0::NormalRangeInvCdf(1.0, 3)));
  EXPECT_EQ(qel::v0::NormalRangeCdf(2.0, 4, true), qel::mNormalRangeCdf(2.0, 4, true));
  EXPECT_EQ(qel::v0::NormalRangeInvCdf(0.95, 4), qel::mNormalRangeInvCdf(0.95, 4));
  EXPECT_EQ(fegetexcept(), 0);
}

}  // namespace
