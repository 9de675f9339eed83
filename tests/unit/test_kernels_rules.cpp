// The kernels' rules that no single value shows (the values at the ends of
// the ranges are rows of kernel_edges.csv): quantiles found by search invert
// their distribution function, P-values and critical values follow the
// alternative, a missing argument stays missing, finite tables, and the
// limiting forms of the Tukey lambda and noncentral laws.
#include <gtest/gtest.h>

#include <cmath>
#include <map>

#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"

namespace {

using namespace qel;

const double kMissing = mGetMissingValueCode();

bool isMissing(double x) {
  return mIsNumericMissing(x);
}

TEST(ContinuousKernelRules, QuantilesBySearchInvertTheirLaw) {
  // Below the ELV inverse's range the normal quantile is searched on [-36, 0].
  const double z = mNormalInvCdf(1e-250, 0.0, 1.0);
  ASSERT_FALSE(isMissing(z));
  EXPECT_NEAR(mNormalCdf(z, 0.0, 1.0, false) / 1e-250, 1.0, 1e-9);
  // The noncentral chi-square quantile is a search from [0, 1e30].
  const double q = mChiSqInvCdf(0.3, 6.0, 2.5);
  EXPECT_NEAR(mChiSqCdf(q, 6.0, 2.5, false), 0.3, 1e-12);
  EXPECT_NEAR(mChiSqInvCdfByRootFinder(0.3, 6.0, 2.5, 1.0) / q, 1.0, 1e-10);
  const double g = mGammaInvCdfByRootFinder(0.7, 3.5, 0.25);
  EXPECT_NEAR(mGammaCdf(g, 3.5, 1.0, 0.0, false), 0.7, 1e-12);
  // Noncentral t quantiles with no variance (df <= 2) start from a bracket
  // next to the mean.
  for (double df : {1.0, 2.0, 7.0}) {
    for (double p : {0.02, 0.5, 0.97}) {
      const double t = mTInvCdf(p, df, 1.2);
      ASSERT_FALSE(isMissing(t)) << df << " " << p;
      EXPECT_NEAR(mTCdf(t, df, 1.2, false), p, 1e-10 * p) << df << " " << p;
    }
  }
  // The smallest k with P(X <= k) >= p.
  for (double p = 0.01; p < 1.0; p += 0.0625) {
    const double k = mIntegerUniformInvCdf(p, -3, 8);
    EXPECT_GE(mIntegerUniformCdf(k, -3, 8, false), p);
    EXPECT_LT(mIntegerUniformCdf(k - 1.0, -3, 8, false), p);
  }
}

TEST(ContinuousKernelRules, PValuesAndCriticalValues) {
  EXPECT_EQ(mNormalPValue(0.0, kAlternativeLess), 0.5);
  EXPECT_EQ(mNormalPValue(0.0, kAlternativeNotEqual), 1.0);
  EXPECT_EQ(mNormalPValue(1.5, static_cast<EAlternative>(3)), 0.0);
  EXPECT_DOUBLE_EQ(mNormalPValue(-1.5, kAlternativeNotEqual),
                   2.0 * mNormalCdf(-1.5, 0.0, 1.0, false));
  EXPECT_DOUBLE_EQ(mNormalPValue(-1.5, kAlternativeGreater), mNormalCdf(1.5, 0.0, 1.0, false));
  // One-sided critical values do not depend on the direction.
  const double c = mNormalCritValue(0.05, kAlternativeLess);
  EXPECT_EQ(c, mNormalCritValue(0.05, kAlternativeGreater));
  EXPECT_NEAR(mNormalCdf(c, 0.0, 1.0, true), 0.05, 1e-15);
  EXPECT_NEAR(mNormalCdf(mNormalCritValue(0.05, kAlternativeNotEqual), 0.0, 1.0, true), 0.025,
              1e-15);
  EXPECT_TRUE(isMissing(mNormalCritValue(0.05, static_cast<EAlternative>(4))));
  EXPECT_EQ(mChiSqPValue(-1.0, 3.0, kAlternativeGreater), 1.0);
  EXPECT_EQ(mChiSqPValue(-1.0, 3.0, kAlternativeNotEqual), 0.0);
  EXPECT_DOUBLE_EQ(mChiSqPValue(2.0, 3.0, kAlternativeNotEqual),
                   2.0 * mChiSqCdf(2.0, 3.0, 0.0, false));
  EXPECT_EQ(mChiSqCritValue(0.05, 3.0, kAlternativeNotEqual), 0.0);
  EXPECT_NEAR(mChiSqCdf(mChiSqCritValue(0.05, 3.0, kAlternativeGreater), 3.0, 0.0, true), 0.05,
              1e-12);
  EXPECT_NEAR(mChiSqCdf(mChiSqCritValue(0.05, 3.0, kAlternativeLess), 3.0, 0.0, false), 0.05,
              1e-12);
  // Bonferroni over 2 comparisons, two-sided: p = 1 - 0.05/2/2 = 0.9875.
  EXPECT_NEAR(mTCdf(mTCritValue(0.05, 10.0, kAlternativeNotEqual, 2), 10.0, 0.0, true), 0.0125,
              1e-12);
  EXPECT_NEAR(mTCdf(mTCritValue(0.05, 10.0, kAlternativeLess, 1), 10.0, 0.0, true), 0.05, 1e-12);
  const double sidak = 1.0 - std::pow(0.95, 1.0 / 3.0);
  EXPECT_NEAR(mTCdf(mTSidakCritValue(0.05, 7.0, kAlternativeGreater, 3), 7.0, 0.0, true), sidak,
              1e-12);
  EXPECT_TRUE(isMissing(mTCritValue(0.05, 10.0, static_cast<EAlternative>(5), 1)));
  EXPECT_EQ(mFCritValue(0.05, 3.0, 4.0, kAlternativeNotEqual), 0.0);
  EXPECT_NEAR(mFCdf(mFCritValue(0.05, 3.0, 4.0, kAlternativeGreater), 3.0, 4.0, 0.0, true), 0.05,
              1e-12);
  EXPECT_NEAR(mFCdf(mFCritValue(0.05, 3.0, 4.0, kAlternativeLess), 3.0, 4.0, 0.0, false), 0.05,
              1e-12);
  // t P-values have no special case at 0: the routine's tails, 1/2 each.
  EXPECT_DOUBLE_EQ(mTPValue(0.0, 5.0, kAlternativeNotEqual), 1.0);
  EXPECT_DOUBLE_EQ(mTPValue(-2.0, 5.0, kAlternativeNotEqual), 2.0 * mTCdf(-2.0, 5.0, 0.0, false));
  EXPECT_EQ(mTPValue(-2.0, 5.0, static_cast<EAlternative>(9)), 0.0);
  EXPECT_EQ(mFPValue(-1.0, 3.0, 4.0, kAlternativeGreater), 1.0);
}

TEST(ContinuousKernelRules, MissingArgumentsStayMissing) {
  EXPECT_TRUE(isMissing(mNormalCdf(kMissing, 0.0, 1.0, false)));
  EXPECT_TRUE(isMissing(mNormalPValue(kMissing, kAlternativeLess)));
  EXPECT_TRUE(isMissing(mChiSqCdf(kMissing, 3.0, 0.0, true)));
  EXPECT_TRUE(isMissing(mChiSqPValue(kMissing, 3.0, kAlternativeLess)));
  EXPECT_TRUE(isMissing(mFPValue(kMissing, 3.0, 4.0, kAlternativeLess)));
  EXPECT_TRUE(isMissing(mTPValue(kMissing, 3.0, kAlternativeLess)));
  double lower = 0.0, upper = 0.0;
  EXPECT_FALSE(mNormalCdf(kMissing, 0.0, 1.0, &lower, &upper));
  EXPECT_TRUE(isMissing(lower) && isMissing(upper));
  EXPECT_TRUE(mNormalCdf(2.0, 2.0, 1.0, &lower, &upper));
  EXPECT_EQ(lower, 0.5);
  EXPECT_EQ(upper, 0.5);
  EXPECT_TRUE(mChiSqCdf(-1.0, 3.0, 0.0, &lower, &upper));
  EXPECT_EQ(lower, 0.0);
  EXPECT_EQ(upper, 1.0);
  EXPECT_FALSE(mTCdf(kMissing, 10.0, 0.0, &lower, &upper));
  EXPECT_TRUE(mTCdf(1.5, 10.0, 0.5, &lower, &upper));
  EXPECT_DOUBLE_EQ(lower, mTCdf(1.5, 10.0, 0.5, false));
  EXPECT_DOUBLE_EQ(upper, mTCdf(1.5, 10.0, 0.5, true));
  CmChiSqCdf f(3.0, 0.0, 0.5);
  EXPECT_TRUE(isMissing(f(kMissing)));
  EXPECT_EQ(f(-1.0), -0.5);
  CmTCdf t(5.0, 0.0, 0.5);
  EXPECT_TRUE(isMissing(t(kMissing)));
}

TEST(ContinuousKernelRules, LimitingForms) {
  // lambda within 1e-12 of 0 is the logistic distribution of z.
  EXPECT_DOUBLE_EQ(mLambdaCdf(0.7, 1e-13, 0.0, 1.0, false), mLogisticCdf(0.7, 0.0, 1.0, false));
  EXPECT_DOUBLE_EQ(mLambdaInvCdf(0.3, 0.0, 2.0, 3.0), 2.0 + 3.0 * mLogisticInvCdf(0.3, 0.0, 1.0));
  EXPECT_FALSE(isMissing(mLambdaInvCdf(0.2, -0.5, 0.0, 1.0)));
  // Its distribution function solves Q(p) = x inside (0, 1).
  EXPECT_NEAR(mLambdaCdf(mLambdaInvCdf(0.2, -0.5, 0.0, 1.0), -0.5, 0.0, 1.0, false), 0.2, 1e-12);
  CmLambdaTransform transform(0.5, 0.25);
  EXPECT_NEAR(transform(0.75), (std::sqrt(0.75) - std::sqrt(0.25)) / 0.5 - 0.25, 1e-15);
  // A noncentrality below 2.2250738585072014e-307 is the central F.
  EXPECT_EQ(mFCdf(1.3, 3.0, 8.0, 1e-310, false), mFCdf(1.3, 3.0, 8.0, 0.0, false));
  EXPECT_EQ(mFInvCdf(0.3, 3.0, 8.0, 1e-310), mFInvCdf(0.3, 3.0, 8.0, 0.0));
  // The incomplete beta ratio serves n beyond the integer range: 18.26
  // standard deviations below the mean of a fair binomial on 3e9 trials the
  // tail is close to the normal one, 8e-75.
  const double tail = mBinomialCdf(3e9 * 0.5 - 5e5, 3e9, 0.5, false);
  EXPECT_GT(tail, 1e-76);
  EXPECT_LT(tail, 1e-73);
}

TEST(DiscreteKernelRules, FiniteTables) {
  const std::map<double, double> table = {{1.0, 0.25}, {2.0, 0.5}, {4.0, 0.25}};
  EXPECT_EQ(mDiscretePdf(2.0, table), 0.5);
  EXPECT_EQ(mDiscretePdf(3.0, table), 0.0);
  EXPECT_EQ(mDiscreteCdf(0.5, table, false), 0.0);
  EXPECT_EQ(mDiscreteCdf(2.0, table, false), 0.75);
  EXPECT_EQ(mDiscreteCdf(3.0, table, false), 0.75);
  EXPECT_EQ(mDiscreteCdf(5.0, table, false), 1.0);
  // The upper tail includes the point.
  EXPECT_EQ(mDiscreteCdf(2.0, table, true), 0.75);
  EXPECT_EQ(mDiscreteCdf(1.0, table, true), 1.0);
  EXPECT_EQ(mDiscreteCdf(0.0, table, true), 1.0);
  EXPECT_EQ(mDiscreteCdf(4.0, table, true), 0.25);
  EXPECT_EQ(mDiscreteInvCdf(0.1, table), 1.0);
  EXPECT_EQ(mDiscreteInvCdf(0.25, table), 1.0);
  EXPECT_EQ(mDiscreteInvCdf(0.3, table), 2.0);
  EXPECT_EQ(mDiscreteInvCdf(1.0, table), 4.0);
  const std::multimap<double, double> cumulative = {{0.25, 1.0}, {0.75, 2.0}, {1.0, 4.0}};
  EXPECT_EQ(mDiscreteInvCdf(0.25, cumulative), 1.0);
  EXPECT_EQ(mDiscreteInvCdf(0.5, cumulative), 2.0);
  EXPECT_EQ(mDiscreteInvCdf(0.99, cumulative), 4.0);
}

}  // namespace
