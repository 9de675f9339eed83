// Both tails and quantiles of the noncentral t against mpmath
// (tools/reference/gen_noncentral_t_grid.py): the body over df from 0.5 to
// 5000 and both signs of t and delta, the far tails down to 1e-113 and the
// upper tail near 1e-40 at t = 1e8 with delta = 1e-20.
#include <gtest/gtest.h>
#include <qel/distributions.h>

#include <cmath>

#include "reference_data.h"

namespace {

TEST(NoncentralT, TailsAndQuantilesAtDoublePrecision) {
  const auto rows = qeltest::loadReferenceData("noncentral_t_grid.csv", 1);
  int oppositeSigns = 0;
  for (const auto& row : rows) {
    const std::string& f = row.text[0];
    const double x = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const double expected = row.numbers[3];
    const bool inverse = f == "inv";
    const double actual =
        inverse ? qel::TInvCdf(x, df, delta) : qel::TCdf(x, df, delta, f == "upper");
    const bool far = inverse ? x < 1e-6 || x > 1.0 - 1e-6 : expected < 1e-6;
    EXPECT_LE(qeltest::relativeError(actual, expected), far ? 1e-12 : 2e-14)
        << f << " line " << row.line << ": " << actual << " vs " << expected;
    if (f == "lower" && x * delta < 0.0 && expected < 1e-3) ++oppositeSigns;
  }
  // The cancelling case must be well represented.
  EXPECT_GT(oppositeSigns, 40);
  EXPECT_GT(rows.size(), 500u);
}

}  // namespace
