// The normal range distribution against mpmath integrals
// (tools/reference/gen_normal_range.py): both tails, their inverses, edges.
#include <gtest/gtest.h>

#include <cmath>

#include "reference_data.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/normal_range.h"

namespace {

using qeltest::relativeError;

TEST(NormalRange, MatchesMpmath) {
  const auto rows = qeltest::loadReferenceData("normal_range.csv", 1);
  ASSERT_EQ(rows.size(), 29u);
  for (const auto& row : rows) {
    const auto& v = row.numbers;
    const int k = int(v[0]);
    // The (k-1)th power spreads the error of Phi(x + r) - Phi(x).
    const double tol = 2e-13 * k;
    EXPECT_LE(relativeError(qel::mNormalRangeCdf(v[1], k, false), v[2]), tol) << row.line;
    EXPECT_LE(relativeError(qel::mNormalRangeCdf(v[1], k, true), v[3]), tol) << row.line;
    EXPECT_EQ(qel::mNormalRangePValue(v[1], k), qel::mNormalRangeCdf(v[1], k, true));
    // Quantiles from the smaller tail, where it is representable; the
    // slope of that tail in r sets the attainable accuracy.
    if (v[2] <= 0.5 && v[2] > 1e-300) {
      EXPECT_LE(relativeError(qel::mNormalRangeInvCdf(v[2], k), v[1]), 1e-12) << row.line;
    }
    if (v[3] < 0.5 && v[3] > 1e-300) {
      EXPECT_LE(relativeError(qel::mNormalRangeCritValue(v[3], k), v[1]), 1e-12) << row.line;
    }
  }
}

TEST(NormalRange, FarTailAndEdges) {
  // At r = 30 two pairs rarely exceed r together (relative 1e-90): P(R > r)
  // is C(k, 2) erfc(15); erfc(15) from mpmath, as written for k = 2.
  for (int k : {3, 10, 50})
    EXPECT_LE(relativeError(qel::mNormalRangeCdf(30, k, true),
                            k * (k - 1) / 2 * 7.21299417245120667e-100),
              1e-12);
  EXPECT_TRUE(qel::mNormalRangeCdf(0.0, 5, false) == 0 &&
              qel::mNormalRangeCdf(-1.0, 5, true) == 1 && qel::mNormalRangeInvCdf(0.0, 4) == 0);
  EXPECT_TRUE(qel::mIsNumericMissing(qel::mNormalRangeCdf(1.0, 1, false)) &&
              qel::mIsNumericMissing(qel::mNormalRangeCdf(std::nan(""), 3, false)) &&
              qel::mIsNumericMissing(qel::mNormalRangeInvCdf(1.0, 3)) &&
              qel::mIsNumericMissing(qel::mNormalRangeCritValue(0.0, 3)));
}

}  // namespace
