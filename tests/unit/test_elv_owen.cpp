// Complementary Owen's T against mpmath (tools/reference/gen_elv_t_noncentral.py,
// two independent integrals agreeing to 25 digits), across the four regions of
// a, their borders, g around 1, h = 0, negative h and tails down to 1e-300.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <cmath>
#include <cstdio>

#include "reference_data.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

// Regions of a: gamma series (a > 1.333333), double series (0.75..1), and
// their reflections (1..1.333333 and a < 0.75).
int regionOf(double a) {
  if (a > 1.333333) return 0;
  if (a >= 0.75 && a <= 1.0) return 1;
  if (a > 1.0) return 2;
  return 3;
}

TEST(ElvOwen, ComplementaryOwenTMatchesReference) {
  const char* const names[] = {"a > 1.333333", "0.75 <= a <= 1", "1 < a <= 1.333333", "a < 0.75"};
  double worst[4] = {0.0, 0.0, 0.0, 0.0};
  double worstNegative = 0.0;
  int rows = 0;
  for (const auto& row : loadReferenceData("elv_owen.csv", 0)) {
    const double h = row.numbers[0], a = row.numbers[1], want = row.numbers[2];
    double got = -2.0;
    ASSERT_EQ(Tha_c(&got, h, a), 0) << "h=" << h << " a=" << a;
    ++rows;
    if (want < 2.2250738585072014e-308) {
      // Subnormal results carry no relative accuracy.
      EXPECT_NEAR(got, want, 1e-310) << "h=" << h << " a=" << a;
      continue;
    }
    const double e = relativeError(got, want);
    EXPECT_LT(e, 1e-14) << "h=" << h << " a=" << a << " got " << got << " want " << want;
    double& slot = h < 0.0 ? worstNegative : worst[regionOf(a)];
    slot = std::max(slot, e);
  }
  EXPECT_GT(rows, 300);
  for (int r = 0; r < 4; ++r)
    std::printf("Tha_c %-18s largest relative error %.3g\n", names[r], worst[r]);
  std::printf("Tha_c h < 0              largest relative error %.3g\n", worstNegative);
}




}  // namespace
