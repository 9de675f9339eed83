// Complementary Owen's T against mpmath quadrature
// (tools/reference/gen_elv_t_noncentral.py), across the four regions of a and
// for tails far below the smallest normal double.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <cmath>
#include <cstdio>

#include "reference_data.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

TEST(ElvOwen, ComplementaryOwenTMatchesReference) {
  double worst = 0.0;
  for (const auto& row : loadReferenceData("elv_owen.csv", 0)) {
    const double h = row.numbers[0], a = row.numbers[1], want = row.numbers[2];
    double got = -2.0;
    ASSERT_EQ(Tha_c(&got, h, a), 0) << "h=" << h << " a=" << a;
    if (want < 1e-300) {
      EXPECT_LT(got, 1e-290) << "h=" << h << " a=" << a;
      continue;
    }
    const double e = relativeError(got, want);
    EXPECT_LT(e, 1e-12) << "h=" << h << " a=" << a << " got " << got << " want " << want;
    worst = std::max(worst, e);
  }
  std::printf("Tha_c largest relative error %.3g\n", worst);
}

TEST(ElvOwen, ReflectionAndRefusal) {
  // Tha_c(h, a) + Tha_c(a h, 1/a) = Q(h) Q(a h).
  const double h = 1.3, a = 0.6;
  double v1, v2, lower, qh, qah;
  ASSERT_EQ(Tha_c(&v1, h, a), 0);
  ASSERT_EQ(Tha_c(&v2, a * h, 1.0 / a), 0);
  normal_df(h, &lower, &qh);
  normal_df(a * h, &lower, &qah);
  EXPECT_NEAR(v1 + v2, qh * qah, 1e-9 * qh * qah);
  double out = 0.0;
  EXPECT_EQ(Tha_c(&out, 1.0, 0.0), 4);
  EXPECT_EQ(Tha_c(&out, 1.0, -2.0), 4);
  EXPECT_EQ(Tha_c(&out, std::nan(""), 1.0), 4);
}

}  // namespace
