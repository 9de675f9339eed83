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

TEST(ElvOwen, ReflectionAndRefusal) {
  // Tha_c(h, a) + Tha_c(a h, 1/a) = Q(h) Q(a h), across the region borders.
  const double pairs[][2] = {{1.3, 0.6}, {2.0, 0.8}, {0.7, 1.2}, {3.0, 2.5}, {0.0, 0.75}};
  for (const auto& p : pairs) {
    const double h = p[0], a = p[1];
    double v1, v2, lower, qh, qah;
    ASSERT_EQ(Tha_c(&v1, h, a), 0);
    ASSERT_EQ(Tha_c(&v2, a * h, 1.0 / a), 0);
    normal_df(h, &lower, &qh);
    normal_df(a * h, &lower, &qah);
    EXPECT_NEAR(v1 + v2, qh * qah, 1e-9 * qh * qah) << "h=" << h << " a=" << a;
  }
  double out = 0.0;
  EXPECT_EQ(Tha_c(&out, 1.0, 0.0), 4);
  EXPECT_EQ(out, -1.0);
  EXPECT_EQ(Tha_c(&out, 1.0, -2.0), 4);
  EXPECT_EQ(Tha_c(&out, std::nan(""), 1.0), 4);
  EXPECT_EQ(Tha_c(&out, 1.0, std::nan("")), 4);
}

TEST(ElvOwen, TermCountFollowsTheConvergenceRate) {
  // The gamma series falls like 1/a^2: at h = 0 its terms are
  // 2^-(2k+1)/(k+1/2) for a = 2, so 1e-15 needs about 25 of them; near
  // a = 4/3 the ratio 9/16 needs about 60, within the cap of 70.
  double out;
  ASSERT_EQ(Tha_c(&out, 0.0, 2.0), 0);
  EXPECT_GE(ELVsteps1, 20);
  EXPECT_LE(ELVsteps1, 28);
  ASSERT_EQ(Tha_c(&out, 0.0, 1.3334), 0);
  EXPECT_GE(ELVsteps1, 50);
  EXPECT_LE(ELVsteps1, 70);
  // The reflected form (a < 0.75) uses the ratio a^2.
  ASSERT_EQ(Tha_c(&out, 1.0, 0.1), 0);
  EXPECT_GE(ELVsteps1, 6);
  EXPECT_LE(ELVsteps1, 10);
  // At a = 1 the value is Q(h)^2/2 without any term.
  ASSERT_EQ(Tha_c(&out, 2.0, 1.0), 0);
  EXPECT_EQ(ELVsteps1, 0);
  // Near a = 1 the double series needs few terms, more as w = 1 - a grows.
  ASSERT_EQ(Tha_c(&out, 1.0, 0.9999), 0);
  const long nearOne = ELVsteps1;
  ASSERT_EQ(Tha_c(&out, 1.0, 0.75), 0);
  EXPECT_GE(nearOne, 2);
  EXPECT_GT(ELVsteps1, nearOne);
  EXPECT_LE(ELVsteps1, 200);
}

TEST(ElvOwen, ExtremeArgumentsStayInRange) {
  // h far out on either side, a at the ends of its range: results stay
  // within [0, 1/2] and follow the limits of the integral.
  double out = -2.0;
  ASSERT_EQ(Tha_c(&out, 1e300, 0.5), 0);
  EXPECT_EQ(out, 0.0);
  ASSERT_EQ(Tha_c(&out, -1e300, 0.5), 0);
  EXPECT_NEAR(out, 0.5, 1e-16);  // P(Y > a X) = 1/2
  ASSERT_EQ(Tha_c(&out, 1.0, 1e-320), 0);
  EXPECT_NEAR(out, 0.5 * 0.15865525393145705, 1e-17);
  ASSERT_EQ(Tha_c(&out, 0.0, 1e200), 0);
  EXPECT_NEAR(out, 1.0 / (2.0 * 3.141592653589793 * 1e200), 1e-215);
}

}  // namespace
