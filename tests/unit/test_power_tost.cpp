// Equivalence (TOST) power against mpmath and R, and the difference and
// sample-size solves: targets, mirrors, markers and warm-started lists.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <vector>

#include "basic_statistics/PowerTOST.h"
#include "reference_data.h"
#include "utilities/LYNBasicTypes.h"

namespace {

using qel::CmCmndPowerTOST;
const double kMissing = qel::mGetMissingValueCode();
bool missing(double x) { return qel::mIsNumericMissing(x); }

double power(const std::vector<double>& c) {
  return CmCmndPowerTOST::mTOSTPower(
      static_cast<int>(c[1]), c[2], 0.0, c[4], c[3], false, false, false, false, c[5], c[6],
      static_cast<qel::ETOSTTestType>(static_cast<int>(c[0])), qel::kAlternativeNotEqual);
}

TEST(TOSTPower, MatchesNoncentralTReferencesAndStaysBelowExact) {
  const auto mp = qeltest::loadReferenceData("tost_power.csv", 0);
  const auto r = qeltest::loadReferenceData("tost_power_r.csv", 0);
  ASSERT_EQ(mp.size(), r.size());
  for (std::size_t i = 0; i < mp.size(); ++i) {
    const auto& c = mp[i].numbers;
    const double p = power(c);
    EXPECT_NEAR(p, c[7], 1e-10 + 1e-9 * c[7]) << "line " << mp[i].line;
    EXPECT_NEAR(p, r[i].numbers[7], 1e-10 + 1e-9 * c[7]) << "line " << mp[i].line;
    EXPECT_LE(p, c[8] * (1.0 + 1e-9)) << "line " << mp[i].line;
  }
}

// A two-sided command on limits (lower, upper), sigma 1.
void setUp(CmCmndPowerTOST& c, double lower, double upper, bool ratio = false) {
  c.mSetRatio(ratio);
  c.mSetLimits(lower, upper);
  c.mSetAlternative(qel::kAlternativeNotEqual);
  c.mSetSigma(1.0);
}

TEST(TOSTPower, DifferenceSolveGivesMirrorPairAtTarget) {
  CmCmndPowerTOST probe;
  setUp(probe, -1.0, 1.0);
  const double target = probe.mCalcTOSTPower(-0.3, 20);
  CmCmndPowerTOST c;
  setUp(c, -1.0, 1.0);
  c.mSetSampleSizes({20});
  c.mSetPowers({target});
  c.mComputeAndStore();
  const auto& e = c.mGetResultEffects();
  ASSERT_EQ(e.size(), 2u);
  EXPECT_NEAR(e[0], -0.3, 1e-7);
  EXPECT_NEAR(e[1], 0.3, 1e-7);

  // Ratios: limits 0.8, 1.25 are centred on 1 in the logs, so a root and its
  // mirror multiply to 1, and the ratio 1 has the peak power.
  CmCmndPowerTOST q;
  setUp(q, 0.8, 1.25, true);
  q.mSetSigma(0.25);
  q.mSetSampleSizes({30});
  q.mSetPowers({0.6});
  q.mComputeAndStore();
  const auto& re = q.mGetResultEffects();
  ASSERT_EQ(re.size(), 2u);
  EXPECT_NEAR(re[0] * re[1], 1.0, 1e-9);
  EXPECT_NEAR(q.mCalcTOSTPower(std::log(re[0]), 30), 0.6, 1e-7);
  EXPECT_GT(q.mCalcTOSTPower(0.0, 30), q.mCalcTOSTPower(0.01, 30));
  EXPECT_NEAR(q.mGetPowerAtCenter(), q.mCalcTOSTPower(0.0, 30), 1e-15);
}

TEST(TOSTPower, PeakLowerLimitAndDegenerateCases) {
  CmCmndPowerTOST c;
  setUp(c, -1.0, 1.0);
  const double peak = c.mCalcTOSTPower(0.0, 10);
  EXPECT_TRUE(missing(c.mCalcTOSTMeansDifference(peak + 0.01, 10)));
  // At large n the power at the limit is about the level, above 0.01.
  EXPECT_EQ(c.mCalcTOSTMeansDifference(0.01, 2000), -1.0);
  // A peak of 1: the flat top must not stop the search.
  const double d = c.mCalcTOSTMeansDifference(0.9, 5000);
  EXPECT_NEAR(c.mCalcTOSTPower(d, 5000), 0.9, 1e-7);

  CmCmndPowerTOST over;
  setUp(over, -1.0, 1.0);
  over.mSetSampleSizes({10});
  over.mSetPowers({peak + 0.01});
  over.mComputeAndStore();
  ASSERT_EQ(over.mGetResultEffects().size(), 1u);
  EXPECT_TRUE(missing(over.mGetResultEffects()[0]));

  c.mSetSigma(0.0);
  EXPECT_TRUE(missing(c.mCalcTOSTPower(0.0, 10)));
  // Missing, unordered and non-positive ratio limits: missing rows.
  const double limits[][3] = {{kMissing, 1.0, 0}, {1.0, -1.0, 0}, {0.0, 1.25, 1}, {-0.8, 1.25, 1}};
  for (const auto& l : limits) {
    CmCmndPowerTOST b;
    setUp(b, l[0], l[1], l[2] != 0);
    b.mSetEffects({l[2] != 0 ? 1.0 : 0.0});
    b.mSetPowers({0.8});
    b.mComputeAndStore();
    EXPECT_EQ(b.mGetResultSampleSizes(), std::vector<int>{-1});
    EXPECT_TRUE(missing(b.mGetResultPowers()[0]));
  }
}

TEST(TOSTPower, SeveralDifferencesAgreeWithSinglePairs) {
  CmCmndPowerTOST c;
  setUp(c, -1.0, 1.0);
  c.mSetSampleSizes({40, 20});
  c.mSetPowers({0.9, 0.5, 0.99});
  c.mComputeAndStore();
  const auto& e = c.mGetResultEffects();
  const auto& n = c.mGetResultSampleSizes();
  // Sorted: n 20 then 40, powers 0.5, 0.9, 0.99; the peak at n = 20 lies
  // between 0.5 and 0.9, that at n = 40 above 0.99.
  ASSERT_EQ(n, (std::vector<int>{20, 20, 20, 20, 40, 40, 40, 40, 40, 40}));
  std::size_t k = 0;
  for (int size : {20, 40}) {
    for (double p : {0.5, 0.9, 0.99}) {
      CmCmndPowerTOST one;
      setUp(one, -1.0, 1.0);
      const double d = one.mCalcTOSTMeansDifference(p, size);
      if (missing(d)) {
        EXPECT_TRUE(missing(e[k++]));
        continue;
      }
      EXPECT_NEAR(e[k++], d, 1e-7) << size << " " << p;
      EXPECT_NEAR(e[k++], -d, 1e-7);
    }
  }
}

TEST(TOSTPower, SampleSizeIsSmallestReachingTarget) {
  for (int type = 0; type < 3; ++type) {
    for (double d : {0.0, -0.3, 0.45}) {
      CmCmndPowerTOST c;
      setUp(c, -0.5, 0.5);
      c.mSetTestType(static_cast<qel::ETOSTTestType>(type));
      c.mSetEffects({d});
      c.mSetPowers({0.8});
      c.mComputeAndStore();
      const int n = c.mGetResultSampleSizes()[0];
      ASSERT_GT(n, 2);
      EXPECT_GE(c.mCalcTOSTPower(d, n), 0.8);
      EXPECT_LT(c.mCalcTOSTPower(d, n - 1), 0.8);
      EXPECT_EQ(c.mGetResultPowers()[0], c.mCalcTOSTPower(d, n));
    }
  }
  // A difference on the limit never reaches 0.8: the 999999 marker.
  CmCmndPowerTOST lim;
  setUp(lim, -0.5, 0.5);
  EXPECT_EQ(lim.mCalcTOSTSampleSize(-0.5, 0.8), 999999);
  lim.mSetSigma(0.0);
  EXPECT_EQ(lim.mCalcTOSTSampleSize(0.0, 0.8), -1);
}

TEST(TOSTPower, SeveralSampleSizesAndTheClosestToCentreShortcut) {
  CmCmndPowerTOST c;
  setUp(c, -1.0, 1.0);
  c.mSetEffects({0.2, -0.4});
  c.mSetPowers({0.9, 0.7});
  c.mComputeAndStore();
  const auto& n = c.mGetResultSampleSizes();
  ASSERT_EQ(n.size(), 4u);
  std::size_t k = 0;
  for (double d : {-0.4, 0.2}) {
    for (double p : {0.7, 0.9}) {
      CmCmndPowerTOST one;
      setUp(one, -1.0, 1.0);
      EXPECT_EQ(n[k++], one.mCalcTOSTSampleSize(d, p)) << d << " " << p;
    }
  }
  // Both -0.9 and -0.3 are less than one unit from the centre; the first,
  // -0.9, is taken as the closest. With sigma 30 it needs more than 999999,
  // so every row is marked though -0.3 alone is solvable.
  CmCmndPowerTOST s;
  setUp(s, -1.0, 1.0);
  s.mSetSigma(30.0);
  s.mSetEffects({-0.3, -0.9});
  s.mSetPowers({0.8});
  s.mComputeAndStore();
  EXPECT_EQ(s.mGetResultSampleSizes(), (std::vector<int>{999999, 999999}));
  CmCmndPowerTOST alone;
  setUp(alone, -1.0, 1.0);
  alone.mSetSigma(30.0);
  EXPECT_LT(alone.mCalcTOSTSampleSize(-0.3, 0.8), 999999);
}

TEST(TOSTPower, OneSidedSolvesReachTarget) {
  for (int alt : {-1, 1}) {
    CmCmndPowerTOST c;
    c.mSetLimits(-1.0, 1.0);
    c.mSetAlternative(static_cast<qel::EAlternative>(alt));
    c.mSetSampleSizes({15});
    c.mSetPowers({0.8});
    c.mComputeAndStore();
    const double d = c.mGetResultEffects()[0], e = alt > 0 ? -0.4 : 0.4;
    EXPECT_NEAR(c.mCalcTOSTPower(d, 15), 0.8, 1e-7) << alt;
    EXPECT_TRUE(alt > 0 ? d > -1.0 : d < 1.0);
    CmCmndPowerTOST s;
    s.mSetLimits(-1.0, 1.0);
    s.mSetAlternative(static_cast<qel::EAlternative>(alt));
    s.mSetEffects({e});
    s.mSetPowers({0.8});
    s.mComputeAndStore();
    const int n = s.mGetResultSampleSizes()[0];
    EXPECT_GE(s.mCalcTOSTPower(e, n), 0.8);
    EXPECT_LT(s.mCalcTOSTPower(e, n - 1), 0.8);
  }
}

TEST(TOSTPower, ScaleEndsFollowTheAlternativeAndRatio) {
  for (int alt : {-1, 0, 1}) {
    CmCmndPowerTOST c;
    setUp(c, 0.8, 1.25, true);
    c.mSetAlternative(static_cast<qel::EAlternative>(alt));
    double low = 0.0, high = 0.0;
    c.mGetScaleMinMax(nullptr, nullptr, low, high);
    EXPECT_TRUE(alt < 0 ? missing(low) : std::fabs(low - 0.8) < 1e-15) << alt;
    EXPECT_TRUE(alt > 0 ? missing(high) : std::fabs(high - 1.25) < 1e-15) << alt;
  }
}

TEST(TOSTPower, SuggestedExtentsOneSidedEndAndData) {
  // One-sided: both ends start at d, the difference of power 0.99 at the
  // smallest n (15); equal ends then open to [d, d + max(|d|, 1)].
  qel::CmCmndPowerTOST c;
  c.mSetLimits(-1.0, 1.0);
  c.mSetAlternative(static_cast<qel::EAlternative>(1));
  c.mSetSampleSizes({15});
  c.mSetPowers({0.8});
  c.mComputeAndStore();
  double lo = 0.0, hi = 0.0;
  c.mGetSuggestedXMinXMax({}, &lo, &hi);
  EXPECT_NEAR(c.mCalcTOSTPower(lo, 15), 0.99, 1e-7);
  EXPECT_DOUBLE_EQ(hi, lo + std::max(std::fabs(lo), 1.0));
  // Two-sided: the ends come from the data alone, missing values skipped:
  // from [0, 0], lo = min(-0.5 - 0, 0) = -0.5 and
  // hi = max(0.7 + 0.015 (0 - (-0.5)), 0) = 0.7075.
  qel::CmCmndPowerTOST t;
  t.mSetLimits(-1.0, 1.0);
  lo = hi = 0.0;
  t.mGetSuggestedXMinXMax({-0.5, qel::mGetMissingValueCode(), 0.7}, &lo, &hi);
  EXPECT_EQ(lo, -0.5);
  EXPECT_NEAR(hi, 0.7075, 1e-15);
}

}  // namespace
