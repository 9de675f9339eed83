// Power commands: which quantity is solved, rows and their order, storage,
// failed solves, request checks and the extents of a power curve.
#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "basic_statistics/Power.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"

namespace {

const double kMissing = qel::mGetMissingValueCode();

TEST(PowerCommands, RowsInLoopOrderWithStorage) {
  qel::CmCmndVariance v;
  v.mSetTwoSample(true);
  v.mSetTestMethod(qel::kVarianceChiSquareOrF);
  v.mSetSampleSizes({10, 20});
  v.mSetPowers({0.8, 0.9});
  std::vector<double> n(10, -7.0), e(10, -7.0), p(10, -7.0);
  v.mSetStorageSample(&n);
  v.mSetStorageEffect(&e);
  v.mSetStoragePower(&p);
  ASSERT_TRUE(v.mComputeAndStore());
  // Two rows per (n, power) for the two-sided alternative, the ratio above
  // one first.
  EXPECT_EQ(v.mGetResultSampleSizes(), (std::vector<int>{10, 10, 10, 10, 20, 20, 20, 20}));
  const auto& r = v.mGetResultEffects();
  ASSERT_EQ(r.size(), 8u);
  for (int k = 0; k < 8; k += 2) {
    EXPECT_GT(r[k], 1.0);
    EXPECT_LT(r[k + 1], 1.0);
    EXPECT_NEAR(v.mGetPower(n[k], r[k]), p[k], 1e-9);
    EXPECT_NEAR(v.mGetPower(n[k], r[k + 1]), p[k + 1], 1e-9);
  }
  EXPECT_LT(r[0], r[2]);  // more power needs a larger ratio
  EXPECT_EQ(n.size(), 10u);
  EXPECT_EQ(n[8], -7.0);  // storage is written by index, never resized
  EXPECT_EQ(e[3], r[3]);
  EXPECT_TRUE(v.mGetTargetPowers().empty());
}

TEST(PowerCommands, ProportionRootsAndSampleSizes) {
  for (double null : {0.5, 0.4}) {
    qel::CmCmndPowerProportion c;
    c.mSetNull(null);
    c.mSetSampleSizes({30, 60});
    c.mSetPowers({0.7});
    c.mComputeAndStore();
    const auto& x = c.mGetResultEffects();
    ASSERT_EQ(x.size(), null == 0.5 ? 2u : 4u);
    EXPECT_GT(x[0], null);
    if (null == 0.4) {
      EXPECT_LT(x[1], null);
    }
  }
  qel::CmCmndPowerProportion c;
  c.mSetNull(0.3);
  c.mSetAlternative(qel::kAlternativeLess);
  c.mSetEffects({-0.1});
  c.mSetPowers({0.8});
  c.mComputeAndStore();
  const int n = c.mGetResultSampleSizes()[0];
  EXPECT_NEAR(c.mGetResultEffects()[0], 0.2, 1e-15);
  EXPECT_GE(c.mGetResultPowers()[0], 0.8);
  const double crit = qel::mNormalCritValue(0.05, qel::kAlternativeLess);
  EXPECT_LT(qel::mPOneCalcOnePower(qel::kAlternativeLess, n - 1, crit, -0.1, 0.3, true), 0.8);
  EXPECT_EQ(c.mGetTargetPowers(), std::vector<double>{0.8});
}

TEST(PowerCommands, SampleSizeSolvesAndFailures) {
  qel::CmCmndPowerTAndZ t;
  t.mSetTwoSample(true);
  t.mSetEffects({50.0, 0.5});
  t.mSetPowers({0.8});
  t.mComputeAndStore();
  EXPECT_EQ(t.mGetResultSampleSizes(), (std::vector<int>{2, 64}));  // R: 63.77
  EXPECT_EQ(t.mGetResultPowers()[0], qel::mTOneCalcOnePower(qel::kAlternativeNotEqual, 2, 50.0, 1.0,
                                                            0.05, false, true, kMissing));

  qel::CmCmndPowerTAndZ z;
  EXPECT_EQ(z.mSetZTest(true), 1);
  z.mSetEffects({1e-4});
  z.mSetPowers({0.9});
  z.mComputeAndStore();
  EXPECT_EQ(z.mGetResultSampleSizes()[0], 999999);  // the z search end

  qel::CmCmndPowerTAndZ bad;
  bad.mSetSigma(0.0);
  bad.mSetEffects({1.0});
  bad.mSetPowers({0.9});
  std::vector<double> n(1, 0.0);
  bad.mSetStorageSample(&n);
  bad.mComputeAndStore();
  EXPECT_EQ(bad.mGetResultSampleSizes()[0], -1);
  EXPECT_EQ(n[0], kMissing);
  EXPECT_EQ(bad.mGetResultPowers()[0], kMissing);
  EXPECT_EQ(bad.mGetMinN(), -1);
  double lo = 0.0, hi = 0.0;
  bad.mGetSuggestedXMinXMax({}, &lo, &hi);
  EXPECT_TRUE(std::isfinite(lo) && std::isfinite(hi) && lo < hi) << lo << " " << hi;

  qel::CmCmndPowerProportion p;  // no comparison proportion reaches 0.999
  p.mSetNull(0.99);
  p.mSetAlternative(qel::kAlternativeGreater);
  p.mSetSampleSizes({5});
  p.mSetPowers({0.999});
  p.mComputeAndStore();
  EXPECT_EQ(p.mGetResultEffects()[0], kMissing);

  qel::CmCmndVariance v;  // n = 2 already reaches the power
  v.mSetAlternative(qel::kAlternativeGreater);
  v.mSetTestMethod(qel::kVarianceChiSquareOrF);
  v.mSetEffects({1e6});
  v.mSetPowers({0.9});
  v.mComputeAndStore();
  EXPECT_EQ(v.mGetResultSampleSizes()[0], 2);
}

TEST(PowerCommands, PoissonRatesAndLengths) {
  qel::CmCmndPowerPoisson c;
  c.mSetTwoSample(true);
  c.mSetRate(2.0);
  c.mSetLengths({1.5});
  std::vector<double> lengths;
  c.mGetLength(lengths);
  EXPECT_EQ(lengths, (std::vector<double>{1.5, 1.5}));
  c.mSetLengths({});
  c.mGetLength(lengths);
  EXPECT_EQ(lengths, (std::vector<double>{1.0, 1.0}));
  c.mSetEffects({0.8});
  c.mSetPowers({0.9});
  c.mComputeAndStore();
  const int n = c.mGetResultSampleSizes()[0];
  EXPECT_EQ(c.mGetResultEffects()[0], 2.8);  // stored as the comparison rate
  EXPECT_GE(c.mGetResultPowers()[0], 0.9);
  EXPECT_LT(c.mGetPower(n - 1, 0.8), 0.9);
  qel::CmCmndPowerPoisson e;
  e.mSetRate(2.0);
  e.mSetSampleSizes({40});
  e.mSetPowers({0.9});
  e.mComputeAndStore();
  const auto& x = e.mGetResultEffects();
  ASSERT_EQ(x.size(), 2u);
  EXPECT_NEAR(e.mGetPower(40, x[0] - 2.0), 0.9, 1e-9);
  EXPECT_NEAR(e.mGetPower(40, x[1] - 2.0), 0.9, 1e-9);
  EXPECT_GT(x[0], 2.0);
  EXPECT_LT(x[1], 2.0);
}

TEST(PowerCommands, RequestChecks) {
  qel::CmCmndPowerTAndZ c;
  EXPECT_EQ(c.mGetMinN(), static_cast<int>(qel::mGetMaxInteger()));
  c.mSetPowers({0.05, 0.9});
  EXPECT_FALSE(c.mGeneralErrorChecking());  // a power equal to the level
  c.mSetPowersGiven(false);
  EXPECT_TRUE(c.mGeneralErrorChecking());
  EXPECT_FALSE(c.mIsPowerPossible(qel::kAlternativeGreater));
  EXPECT_FALSE(c.mIsExactlyTwoSubcommands());
  c.mSetEffects({-0.3, 0.4});
  c.mSetSampleSizes({});
  EXPECT_TRUE(c.mIsExactlyTwoSubcommands());
  EXPECT_TRUE(c.mComputeAndStore());
  EXPECT_TRUE(c.mGetResultEffects().empty());  // an empty list gives no rows
  EXPECT_TRUE(c.mIsEffectLegal(0.5, 0.0, kMissing));
  EXPECT_FALSE(c.mIsEffectLegal(0.5, 0.2, 1.0));
  EXPECT_FALSE(c.mIsEffectLegal(0.5, kMissing, 0.9));
  EXPECT_EQ(c.mGetNumberOfPossibleSolnEffect(), 2);
  EXPECT_EQ(c.mGetDefaultDiffForSigma(3), 2.0);
}

TEST(PowerCommands, ProcessXMinMax) {
  struct Case {
    bool minGiven, maxGiven;
    double minimum, maximum, absMin, absMax, xMin, xMax;
  };
  const Case cases[] = {
      {false, false, 0, 0, -1.0, kMissing, -1.0, 5.0},  // data [-2, 5] limited below
      {false, true, 0, -4.0, kMissing, kMissing, -11.0, -4.0},
      {false, true, 0, 3.0, kMissing, 2.5, -2.0, 2.5},
      {true, false, 9.0, 0, kMissing, kMissing, 9.0, 16.0},
      {true, false, -1.0, 0, 0.0, kMissing, 0.0, 5.0},
      {true, true, -1.0, 7.0, kMissing, 6.0, -1.0, 6.0},
      {true, false, 9.0, 0, kMissing, 8.0, -2.0, 5.0},  // beyond the absolute maximum
  };
  for (const Case& c : cases) {
    qel::CmCmndPowerTAndZ p;
    if (c.minGiven) p.mSetMinimum(c.minimum);
    if (c.maxGiven) p.mSetMaximum(c.maximum);
    double xMin = 0.0, xMax = 0.0;
    p.mProcessXMinMax(-2.0, 5.0, c.absMin, c.absMax, xMin, xMax);
    EXPECT_EQ(xMin, c.xMin) << c.minimum << " " << c.maximum;
    EXPECT_EQ(xMax, c.xMax) << c.minimum << " " << c.maximum;
  }
  qel::CmCmndPowerTAndZ p;
  double xMin = 1.0, xMax = 3.0;
  p.mGetSuggestedDataXMinXMax({0.0, 10.0}, &xMin, &xMax);
  EXPECT_DOUBLE_EQ(xMin, -0.03);
  EXPECT_DOUBLE_EQ(xMax, 10.0 + 3.03 * 0.015);
  double top = 2.0;
  p.mAdjustForEqualSuggestedMinMax(2.0, &top);
  EXPECT_EQ(top, 4.0);
}

TEST(PowerCommands, SuggestedExtents) {
  qel::CmCmndPowerTAndZ t;
  t.mSetAlternative(qel::kAlternativeLess);
  t.mSetSampleSizes({25});
  t.mSetEffects({-0.5});
  t.mComputeAndStore();
  double lo = 0.0, hi = 0.0;
  t.mGetSuggestedXMinXMax({}, &lo, &hi);
  EXPECT_EQ(hi, 0.0);
  EXPECT_NEAR(
      qel::mTOneCalcOnePower(qel::kAlternativeLess, 25, lo, 1.0, 0.05, true, true, kMissing), 0.99,
      1e-9);
  qel::CmCmndVariance v;
  v.mSetAlternative(qel::kAlternativeGreater);
  v.mSetSampleSizes({30});
  v.mSetEffects({2.0});
  v.mComputeAndStore();
  v.mGetSuggestedXMinXMax({}, &lo, &hi);
  EXPECT_EQ(lo, 1.0);
  EXPECT_NEAR(v.mGetPower(30, hi), 0.99, 1e-9);
}

}  // namespace
