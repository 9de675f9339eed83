// Factorial and one-way power against R, the block and model df rules, and
// the replicate, center-point and effect solves.
#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "basic_statistics/PowerFactorial.h"
#include "reference_data.h"
#include "utilities/LYNBasicTypes.h"

namespace {

using qel::CmCmndPowerFactorial;
bool missing(double x) { return qel::mIsNumericMissing(x); }

// factors, runs, blocks, blocks in model, cp per block, cp in model, omitted df.
void design(CmCmndPowerFactorial& c, const std::vector<double>& v) {
  c.mSetFactorCt(static_cast<int>(v[0]));
  c.mSetRunsPerRep(static_cast<int>(v[1]));
  c.mSetBlockCt(static_cast<int>(v[2]));
  c.mSetBlocksInModel(v[3] != 0);
  c.mSetCenterPntInModel(v[5] != 0);
  c.mSetOmittedEffects(static_cast<int>(v[6]) - c.mGetUniqueCornerPointCt() +
                       static_cast<int>(v[0]) + 1);
  c.mSetSigma(v[9]);
  c.mSetLevel(v[10]);
}

TEST(FactorialPower, MatchesRAndSolvesAreSmallest) {
  for (const auto& row : qeltest::loadReferenceData("factorial_power_r.csv", 0)) {
    const auto& v = row.numbers;
    const int r = static_cast<int>(v[7]), cp = static_cast<int>(v[4]);
    CmCmndPowerFactorial c;
    design(c, v);
    EXPECT_NEAR(c.mPowerAt(r, cp, v[8]), v[12], 5e-9) << "line " << row.line;

    const double target = v[12] > 0.5 ? 0.5 : 0.3;
    CmCmndPowerFactorial s;
    design(s, v);
    s.mSetCenterPoints({cp});
    s.mSetEffects({v[8]});
    s.mSetPowers({target});
    s.mComputeAndStore();
    const int k = s.mGetResultSampleSizes().at(0);
    ASSERT_GE(k, 1) << "line " << row.line;
    EXPECT_GE(s.mGetResultPowers()[0], target);
    EXPECT_TRUE(k <= s.mGetMinRepCt(cp) || s.mPowerAt(k - 1, cp, v[8]) < target);
    EXPECT_EQ(s.mGetResultTotalRuns()[0], k * static_cast<int>(v[1]) + cp * static_cast<int>(v[2]));

    const double e = c.mComputeXForPowerAndSampleSize(0.9, r, cp);
    EXPECT_NEAR(c.mPowerAt(r, cp, e), 0.9, 1e-7) << "line " << row.line;

    // Center points to reach a power between those of the minimum count and
    // of many center points.
    CmCmndPowerFactorial t;
    design(t, v);
    t.mSetSampleSizes({r});
    t.mSetEffects({v[8]});
    const int lo = t.mGetMinCenterPntCtPerBlock(r);
    const double pLo = t.mPowerAt(r, lo, v[8]), pHi = t.mPowerAt(r, lo + 40, v[8]);
    if (!(pHi > pLo + 1e-3) || missing(pLo)) continue;
    t.mSetPowers({(pLo + pHi) / 2.0});
    t.mComputeAndStore();
    const int n = t.mGetResultCenterPoints().at(0);
    EXPECT_GE(t.mPowerAt(r, n, v[8]), (pLo + pHi) / 2.0);
    EXPECT_LT(t.mPowerAt(r, n - 1, v[8]), (pLo + pHi) / 2.0);
  }
}

TEST(FactorialPower, BlocksDegreesOfFreedomAndCaps) {
  struct {
    unsigned runs, fromFactor, toFactor, blocks;
  } const table[] = {{4, 2, 2, 2},    {4, 3, 9, 1},    {8, 3, 4, 4},    {8, 5, 6, 2},
                     {8, 7, 15, 1},   {16, 4, 8, 8},   {16, 9, 12, 4},  {16, 13, 14, 2},
                     {16, 15, 15, 1}, {16, 16, 20, 0}, {16, 1, 3, 0},   {32, 5, 6, 16},
                     {32, 7, 31, 8},  {64, 6, 6, 32},  {64, 7, 63, 16}, {128, 7, 7, 64},
                     {128, 8, 8, 32}, {128, 9, 40, 16}};
  for (const auto& t : table) {
    for (unsigned f = t.fromFactor; f <= t.toFactor; ++f)
      EXPECT_EQ(qel::GetMaxBlocks(f, t.runs), t.blocks) << t.runs << " " << f;
  }
  for (unsigned runs : {0u, 2u, 5u, 12u, 24u, 256u}) EXPECT_EQ(qel::GetMaxBlocks(3, runs), 0u);

  EXPECT_EQ(qel::mGetNonConfoundedDFBlock(3, 4, true), 0);
  EXPECT_EQ(qel::mGetNonConfoundedDFBlock(4, 4, true), 3);
  EXPECT_EQ(qel::mGetNonConfoundedDFBlock(2, 8, true), 4);
  EXPECT_EQ(qel::mGetNonConfoundedDFBlock(4, 4, false), 0);

  // A 2^3 with all two-way terms: 6 model terms give 10 omitted df as the
  // rule is written; 3 - 6 gives the true 1.
  CmCmndPowerFactorial c;
  c.mSetFactorCt(3);
  c.mSetRunsPerRep(8);
  c.mSetOmittedEffects(6);
  EXPECT_EQ(c.mGetOmittedEffects(), 10);
  c.mSetOmittedEffects(3 - 6);
  EXPECT_EQ(c.mGetOmittedEffects(), 1);
  // Saturated, one replicate, no center points: no error df.
  c.mSetOmittedEffects(3 - 7);  // the full model: 7 terms
  EXPECT_EQ(c.mGetOmittedEffects(), 0);
  EXPECT_TRUE(missing(c.mPowerAt(1, 0, 2.0)));
  EXPECT_EQ(c.mGetMinRepCt(0), 2);
  EXPECT_EQ(c.mGetMinCenterPntCtPerBlock(1), 1);
  c.mSetCenterPntCt(5);
  EXPECT_EQ(c.mGetOmittedEffects(), 0);

  CmCmndPowerFactorial pb;
  pb.mSetPlackettBurman(true);
  pb.mSetRunsPerRep(12);
  pb.mSetFactorCt(3);
  EXPECT_EQ(pb.mGetUniqueCornerPointCt(), 8);
  pb.mSetFactorCt(31);
  EXPECT_EQ(pb.mGetUniqueCornerPointCt(), 12);
}

TEST(OnewayPower, MatchesRPowerAnovaTest) {
  for (const auto& row : qeltest::loadReferenceData("oneway_power_r.csv", 0)) {
    const auto& v = row.numbers;
    const int g = static_cast<int>(v[0]);
    qel::CmCmndPowerGFF c;
    c.mSetGroupCt(g);
    c.mSetLevels({g});
    c.mSetSigma(v[3]);
    c.mSetLevel(v[4]);
    EXPECT_NEAR(c.mPowerAt(static_cast<int>(v[1]), v[2]), v[5], 1e-9) << "line " << row.line;
    EXPECT_EQ(c.mComputeXForPowerAndEffect(0.8, v[2]), static_cast<int>(v[6]))
        << "line " << row.line;
    const double s = c.mComputeXForPowerAndSampleSize(0.8, static_cast<int>(v[1]));
    EXPECT_NEAR(c.mPowerAt(static_cast<int>(v[1]), s), 0.8, 1e-7);
  }
}

TEST(OnewayPower, ModelDegreesOfFreedomAndBadLevels) {
  EXPECT_EQ(qel::mGetModelDF(1, {3, 4}, 2, false), 1 + 2 + 3 + 6);
  EXPECT_EQ(qel::mGetModelDF(1, {3, 4}, 1, false), 1 + 2 + 3);
  EXPECT_EQ(qel::mGetModelDF(3, {3, 4}, 1, true), 3 + 2 + 3);
  EXPECT_EQ(qel::mGetModelDF(1, {2, 3, 4}, 3, false), 1 + 6 + (2 + 3 + 6) + 6);
  EXPECT_EQ(qel::mGetModelDF(1, {2, 3, 4}, 2, false), 1 + 6 + (2 + 3 + 6));
  EXPECT_EQ(qel::mGetDenomDF(2, {2, 3, 4}, 3, false), 48 - 24);
  EXPECT_DOUBLE_EQ(qel::mGetMaxDifference(qel::mGetSSMeans(1.7)), 1.7);

  qel::CmCmndPowerGFF c;
  c.mSetGroupCt(4);
  c.mSetLevels({4, 1});
  c.mSetSampleSizes({5});
  c.mCalculateEffectsFromMaxDiff({1.0});
  c.mComputeAndStore();
  EXPECT_TRUE(missing(c.mGetResultPowers().at(0)));
  EXPECT_EQ(c.mGetResultTotalRuns().at(0), -1);

  qel::CmCmndPowerGFF m;
  m.mCalculateEffectsFromMeans({{1.0, 2.0, 4.0}});
  EXPECT_TRUE(m.mIsEffectsGiven());
  m.mSetGroupCt(3);
  m.mSetLevels({3});
  m.mSetSampleSizes({4});
  m.mComputeAndStore();
  // Sum of squares about 7/3: 16/9 + 1/9 + 25/9 = 42/9.
  EXPECT_NEAR(m.mGetResultEffects().at(0), std::sqrt(2.0 * 42.0 / 9.0), 1e-12);
  EXPECT_EQ(m.mGetResultTotalRuns().at(0), 12);
}

}  // namespace

namespace {

TEST(FactorialPower, RowErrorKindsAndSuggestedExtents) {
  // 2^3 with all seven effects in the model and no center points: one
  // replicate leaves 8 - 8 = 0 error df (row 1), two leave 8 (row 2).
  CmCmndPowerFactorial c;
  design(c, {3, 8, 1, 0, 0, 0, 0, 0, 0, 1.0, 0.05});
  c.mSetSampleSizes({1, 2});
  c.mSetEffects({1.0});
  c.mComputeAndStore();
  ASSERT_EQ(c.mGetErrorTypes().size(), 2u);
  EXPECT_EQ(c.mGetErrorTypes()[0], qel::eNoErrorDF);
  EXPECT_EQ(c.mGetErrorTypes()[1], qel::eNoError);
  EXPECT_EQ(c.mGetNoErrorDFRows(), std::vector<int>{1});
  EXPECT_TRUE(c.mGetNotReachedRows().empty() && c.mGetTooManyRunsRows().empty());
  // Effect 0 never lifts the power above the level: the replicate solve
  // reaches no target (row 1); sigma 0 computes nothing.
  for (double sigma : {1.0, 0.0}) {
    CmCmndPowerFactorial n;
    design(n, {3, 8, 1, 0, 0, 0, 0, 0, 0, sigma, 0.05});
    n.mSetEffects({0.0});
    n.mSetPowers({0.8});
    n.mComputeAndStore();
    EXPECT_EQ(n.mGetErrorTypes().at(0), sigma > 0 ? qel::eTargetNotReached : qel::eNotComputable);
  }

  // The smallest stored n is 1, where no effect is solvable (0 error df):
  // d falls back to 6 sigma / 1 = 6, ends -6 and 6.
  double lo = 0.0, hi = 0.0;
  c.mGetSuggestedXMinXMax({}, &lo, &hi);
  EXPECT_EQ(lo, -6.0);
  EXPECT_EQ(hi, 6.0);
  // With n = 2 stored the ends are -d, d, d the effect of power 0.99.
  CmCmndPowerFactorial two;
  design(two, {3, 8, 1, 0, 0, 0, 0, 0, 0, 1.0, 0.05});
  two.mSetSampleSizes({2});
  two.mSetEffects({1.0});
  two.mComputeAndStore();
  two.mGetSuggestedXMinXMax({}, &lo, &hi);
  EXPECT_DOUBLE_EQ(lo, -hi);
  EXPECT_NEAR(two.mPowerAt(2, 0, hi), 0.99, 1e-7);
  // Data beyond the ends widen them by 1.5 percent of the width: from
  // [-d, d] the lower end is -100 - 0.015 (2 d); the upper stays d, as
  // 0 + 0.015 (d + 100 + 0.03 d) is below d for d above about 1.6.
  const double d = hi;
  two.mGetSuggestedXMinXMax({-100.0, 0.0}, &lo, &hi);
  EXPECT_NEAR(lo, -100.0 - 0.03 * d, 1e-12);
  EXPECT_EQ(hi, d);
  // Sigma 0: d falls back to 6 sigma / n = 0, and equal ends open to
  // [0, 0 + max(|0|, 1)] = [0, 1].
  CmCmndPowerFactorial z;
  design(z, {3, 8, 1, 0, 0, 0, 0, 0, 0, 0.0, 0.05});
  z.mSetSampleSizes({2});
  z.mGetSuggestedXMinXMax({}, &lo, &hi);
  EXPECT_EQ(lo, 0.0);
  EXPECT_EQ(hi, 1.0);
}

TEST(OnewayPower, SuggestedExtentsReachHighPower) {
  // One factor with 3 levels, 4 replicates: ends 0 and the maximum
  // difference d whose sum of squares d^2 / 2 gives the high power.
  qel::CmCmndPowerGFF g;
  g.mSetGroupCt(3);
  g.mSetLevels({3});
  g.mSetOrder(1);
  g.mSetSigma(1.0);
  g.mSetLevel(0.05);
  g.mSetSampleSizes({4});
  g.mSetEffects({0.5});
  g.mComputeAndStore();
  double lo = -1.0, hi = 0.0;
  g.mGetSuggestedXMinXMax({}, &lo, &hi);
  EXPECT_EQ(lo, 0.0);
  ASSERT_GT(hi, 0.0);
  EXPECT_NEAR(g.mPowerAt(4, hi * hi / 2.0), 0.99, 1e-7);
}

}  // namespace
