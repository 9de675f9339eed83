// ELV normal routines against mpmath (tools/reference/gen_elv_normal_hyper.py):
// both tails of normal_df to |x| = 40, quantiles down to p = 1e-100, and the
// error codes of the edge cases.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdio>
#include <cstring>

#include "utilities/elv/precision.h"
#include "reference_data.h"
#include "utilities/elv/wrappers.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

TEST(ElvNormal, BothTailsMatchReference) {
  double worst = 0.0;
  for (const auto& row : loadReferenceData("elv_normal.csv", 0)) {
    const double x = row.numbers[0];
    double lower = 0.0, upper = 0.0;
    const qel::ElvStatus status = qel::elv_normal_df(x, &lower, &upper);
    ASSERT_FALSE(qel::ElvFailed(status)) << "x=" << x;
    const double el = relativeError(lower, row.numbers[1]);
    const double eu = relativeError(upper, row.numbers[2]);
    // The gamma series stop at a relative term of 1e-9: the bound is 1e-8.
    // Status 1 stands for a tail below exp(-662.34472) that was set to 0;
    // erfc is cut to 0 beyond 26.5694 without a status.
    if ((status == qel::ElvLossOfSignificance && x < 0) || row.numbers[1] < 1e-300) {
      EXPECT_LT(row.numbers[1], 1e-287) << "x=" << x;
      EXPECT_EQ(lower, 0.0) << "x=" << x;
    } else {
      EXPECT_LT(el, 1e-8) << "x=" << x;
      worst = std::max(worst, el);
    }
    if ((status == qel::ElvLossOfSignificance && x > 0) || row.numbers[2] < 1e-300) {
      EXPECT_LT(row.numbers[2], 1e-287) << "x=" << x;
      EXPECT_EQ(upper, 0.0) << "x=" << x;
    } else {
      EXPECT_LT(eu, 1e-8) << "x=" << x;
      worst = std::max(worst, eu);
    }
  }
  RecordProperty("largest_relative_error", std::to_string(worst));
  std::printf("normal_df largest relative error %.3g\n", worst);
}

TEST(ElvNormal, DensityAndFarTail) {
  EXPECT_DOUBLE_EQ(qel::elv_phi(0.0), 0.39894228040143265);
  double lower, upper;
  normal_df(38.0, &lower, &upper);
  EXPECT_EQ(ELVerrno, 0);
  EXPECT_EQ(upper, 0.0);
  EXPECT_EQ(lower, 1.0);
  normal_df(-38.0, &lower, &upper);
  EXPECT_EQ(lower, 0.0);
  EXPECT_EQ(upper, 1.0);
  EXPECT_STREQ(ELVroutine, "normal_df");
}

TEST(ElvNormal, QuantilesMatchReference) {
  double worst = 0.0;
  for (const auto& row : loadReferenceData("elv_normal_quantiles.csv", 0)) {
    const double p = row.numbers[0], z = row.numbers[1];
    double up = 0.0, low = 0.0, inv = 0.0, invc = 0.0;
    ASSERT_FALSE(qel::ElvFailed(qel::elv_normal_upper_quant(p, &up))) << "p=" << p;
    ASSERT_FALSE(qel::ElvFailed(qel::elv_normal_lower_quant(p, &low))) << "p=" << p;
    ASSERT_FALSE(qel::ElvFailed(qel::elv_inv_normal_df(p, &inv))) << "p=" << p;
    // Absolute error near the centre, where z passes through 0.
    const double tol = 1e-9 * std::max(1.0, std::fabs(z));
    EXPECT_NEAR(up, z, tol) << "p=" << p;
    EXPECT_NEAR(low, -z, tol) << "p=" << p;
    EXPECT_NEAR(inv, -z, tol) << "p=" << p;
    if (p > 1e-16) {
      // 1 - p is rounded; the quantile of the rounded complement is z only
      // to the accuracy of that rounding, relative to the density.
      ASSERT_FALSE(qel::ElvFailed(qel::elv_inv_normal_df(1.0 - p, &invc)));
      EXPECT_NEAR(invc, z, 1e-9 * std::max(1.0, z) + 1e-16 / (p * std::max(z, 1.0)));
    }
    if (z != 0.0) worst = std::max(worst, relativeError(up, z));
  }
  RecordProperty("largest_relative_error", std::to_string(worst));
  std::printf("normal quantile largest relative error %.3g\n", worst);
}

TEST(ElvNormal, QuantileRangeAndLinearCentre) {
  const qel::elv::ScopedElvPrecision historical(qel::elv::ElvPrecision::Historical);
  double z = 0.0;
  EXPECT_EQ(qel::elv_inv_normal_df(1.0, &z), qel::ElvArgumentOutOfRange);
  EXPECT_EQ(z, -DBL_MAX);
  EXPECT_EQ(qel::elv_inv_normal_df(0.5e-100, &z), qel::ElvArgumentOutOfRange);
  EXPECT_STREQ(ELVroutine, "inv_normal_df");
  EXPECT_EQ(qel::elv_normal_upper_quant(0.5000001, &z), qel::ElvArgumentOutOfRange);
  EXPECT_EQ(z, -DBL_MAX);
  EXPECT_EQ(qel::elv_normal_lower_quant(0.6, &z), qel::ElvArgumentOutOfRange);
  EXPECT_STREQ(ELVroutine, "normal_lower_quant");
  // 1 - 2p at most 1e-5: the linear form sqrt(pi/2)(1 - 2p).
  const double p = 0.4999975;
  EXPECT_EQ(qel::elv_normal_upper_quant(p, &z), qel::ElvNoError);
  EXPECT_DOUBLE_EQ(z, 1.2533141373155003 * (1.0 - 2.0 * p));
  EXPECT_EQ(qel::elv_inv_normal_df(0.5, &z), qel::ElvNoError);
  EXPECT_EQ(z, 0.0);
}

TEST(ElvNormal, StartingValueOfAS111) {
  // The published accuracy of AS 111 is about 1e-7 absolute in the body.
  EXPECT_NEAR(inv_normal_df0(0.975), 1.959963984540054, 1e-6);
  EXPECT_NEAR(inv_normal_df0(0.025), -1.959963984540054, 1e-6);
  EXPECT_NEAR(inv_normal_df0(1e-10), -6.361340902404056, 1e-2);
  EXPECT_EQ(inv_normal_df0(0.0), -DBL_MAX);
  EXPECT_EQ(inv_normal_df0(1.0), -DBL_MAX);
}

}  // namespace
