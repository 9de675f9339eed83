// The kernels' prepared values, catches, integer rules and special cases:
// what a kernel answers at the ends of its range and where a formula would
// overflow, and that a missing argument stays missing.
#include <gtest/gtest.h>

#include <cmath>
#include <map>

#include "utilities/distributions/kernels.h"
#include "utilities/LYNBasicTypes.h"

namespace {

using namespace qel;

const double kMissing = mGetMissingValueCode();

bool isMissing(double x) {
  return mIsNumericMissing(x);
}

TEST(ContinuousKernelRules, CatchesGivePreparedValues) {
  // exp(-z) overflows far below the location: the catch answers the tails.
  EXPECT_EQ(mLargestExtremeValueCdf(-1e5, 0.0, 1.0, false), 0.0);
  EXPECT_EQ(mLargestExtremeValueCdf(-1e5, 0.0, 1.0, true), 1.0);
  EXPECT_EQ(mLargestExtremeValuePdf(-1e5, 0.0, 1.0), 0.0);
  EXPECT_EQ(mSmallestExtremeValueCdf(1e5, 0.0, 1.0, true), 0.0);
  EXPECT_EQ(mSmallestExtremeValueCdf(1e5, 0.0, 1.0, false), 1.0);
  // Quantiles at the ends: the checked logarithm of 0 is caught.
  EXPECT_TRUE(isMissing(mLargestExtremeValueInvCdf(0.0, 0.0, 1.0)));
  EXPECT_TRUE(isMissing(mLargestExtremeValueInvCdf(1.0, 0.0, 1.0)));
  EXPECT_TRUE(isMissing(mSmallestExtremeValueInvCdf(0.0, 0.0, 1.0)));
  EXPECT_TRUE(isMissing(mSmallestExtremeValueInvCdf(1.0, 0.0, 1.0)));
  EXPECT_TRUE(isMissing(mExponentialInvCdf(1.0, 2.0, 0.0)));
  EXPECT_TRUE(isMissing(mWeibullInvCdf(1.0, 2.0, 3.0, 0.0)));
  EXPECT_EQ(mWeibullInvCdf(0.0, 2.0, 3.0, 1.5), 1.5);
  EXPECT_TRUE(isMissing(mLaplaceInvCdf(0.0, 1.0, 2.0)));
  EXPECT_TRUE(isMissing(mLaplaceInvCdf(1.0, 1.0, 2.0)));
  EXPECT_EQ(mLaplaceInvCdf(0.5, 1.0, 2.0), 1.0);
  // A density whose exponent overflows (negative scale) is caught.
  EXPECT_TRUE(isMissing(mExponentialPdf(1000.0, -1.0, 0.0)));
  EXPECT_EQ(mNormalPdf(1e200, 0.0, 1e-200), 0.0);
}

TEST(ContinuousKernelRules, ThresholdsAndSupport) {
  EXPECT_EQ(mExponentialCdf(1.0, 2.0, 1.0, false), 0.0);
  EXPECT_EQ(mExponentialCdf(1.0, 2.0, 1.0, true), 1.0);
  EXPECT_EQ(mExponentialPdf(0.5, 2.0, 1.0), 0.0);
  EXPECT_EQ(mExponentialPdf(1.0, 2.0, 1.0), 0.5);
  EXPECT_EQ(mWeibullPdf(1.0, 2.0, 3.0, 1.0), 0.0);
  EXPECT_EQ(mWeibullCdf(1.0, 2.0, 3.0, 1.0, true), 1.0);
  EXPECT_EQ(mLogNormalCdf(2.0, 0.0, 1.0, 2.0, true), 1.0);
  EXPECT_EQ(mLogNormalPdf(2.0, 0.0, 1.0, 2.0), 0.0);
  EXPECT_EQ(mLogNormalInvCdf(0.0, 0.0, 1.0, 2.0), 2.0);
  // Half-normal (x, scale, location): at the location lower 0, upper 1.
  EXPECT_EQ(mHalfNormalCdf(3.0, 2.0, 3.0, false), 0.0);
  EXPECT_EQ(mHalfNormalCdf(3.0, 2.0, 3.0, true), 1.0);
  EXPECT_EQ(mHalfNormalCdf(2.0, 2.0, 3.0, false), 0.0);
  EXPECT_EQ(mHalfNormalPdf(2.0, 2.0, 3.0), 0.0);
  EXPECT_EQ(mGammaCdf(0.5, 2.0, 1.0, 1.0, true), 1.0);
  EXPECT_EQ(mGammaPdf(1.0, 2.0, 1.0, 1.0), 0.0);
  EXPECT_EQ(mChiSqCdf(0.0, 3.0, 0.0, true), 1.0);
  EXPECT_EQ(mChiSqPdf(-1.0, 3.0), 0.0);
}

TEST(ContinuousKernelRules, QuantileSpecialValues) {
  // A gamma quantile of 0 comes back as 0.0 without the threshold, also when
  // the ELV routine reports it as underflowed.
  EXPECT_EQ(mGammaInvCdf(0.0, 2.0, 3.0, 5.0), 0.0);
  EXPECT_EQ(mGammaInvCdf(0.001, 0.01, 1.0, 7.0), 0.0);
  EXPECT_EQ(mChiSqInvCdf(0.0, 4.0, 0.0), 0.0);
  EXPECT_TRUE(isMissing(mChiSqInvCdf(1.0, 4.0, 0.0)));
  EXPECT_TRUE(isMissing(mChiSqInvCdf(1.0, 4.0, 2.0)));
  // Below the ELV inverse's range the normal quantile is searched on
  // [-36, 0]; below the lower tail at -36 there is no answer.
  const double z = mNormalInvCdf(1e-250, 0.0, 1.0);
  ASSERT_FALSE(isMissing(z));
  EXPECT_NEAR(mNormalCdf(z, 0.0, 1.0, false) / 1e-250, 1.0, 1e-9);
  EXPECT_TRUE(isMissing(mNormalInvCdf(1e-320, 0.0, 1.0)));
  EXPECT_TRUE(isMissing(mLogNormalInvCdf(1e-320, 0.0, 1.0, 0.0)));
  // The noncentral chi-square quantile is a search from [0, 1e30].
  const double q = mChiSqInvCdf(0.3, 6.0, 2.5);
  EXPECT_NEAR(mChiSqCdf(q, 6.0, 2.5, false), 0.3, 1e-12);
  const double r = mChiSqInvCdfByRootFinder(0.3, 6.0, 2.5, 1.0);
  EXPECT_NEAR(r / q, 1.0, 1e-10);
  const double g = mGammaInvCdfByRootFinder(0.7, 3.5, 0.25);
  EXPECT_NEAR(mGammaCdf(g, 3.5, 1.0, 0.0, false), 0.7, 1e-12);
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
}

TEST(ContinuousKernelRules, MissingArgumentsStayMissing) {
  EXPECT_TRUE(isMissing(mNormalCdf(kMissing, 0.0, 1.0, false)));
  EXPECT_TRUE(isMissing(mNormalPValue(kMissing, kAlternativeLess)));
  EXPECT_TRUE(isMissing(mChiSqCdf(kMissing, 3.0, 0.0, true)));
  EXPECT_TRUE(isMissing(mChiSqPValue(kMissing, 3.0, kAlternativeLess)));
  double lower = 0.0, upper = 0.0;
  EXPECT_FALSE(mNormalCdf(kMissing, 0.0, 1.0, &lower, &upper));
  EXPECT_TRUE(isMissing(lower) && isMissing(upper));
  EXPECT_TRUE(mNormalCdf(2.0, 2.0, 1.0, &lower, &upper));
  EXPECT_EQ(lower, 0.5);
  EXPECT_EQ(upper, 0.5);
  EXPECT_TRUE(mChiSqCdf(-1.0, 3.0, 0.0, &lower, &upper));
  EXPECT_EQ(lower, 0.0);
  EXPECT_EQ(upper, 1.0);
  // A failed ELV call (negative degrees of freedom) is the missing value.
  EXPECT_TRUE(isMissing(mChiSqCdf(1.0, -3.0, 0.0, false)));
  EXPECT_TRUE(isMissing(mGammaCdf(1.0, -2.0, 1.0, 0.0, false)));
  CmChiSqCdf f(3.0, 0.0, 0.5);
  EXPECT_TRUE(isMissing(f(kMissing)));
  EXPECT_EQ(f(-1.0), -0.5);
}

TEST(ContinuousKernelRules, TukeyLambdaCases) {
  // lambda within 1e-12 of 0 is the logistic distribution of z.
  EXPECT_DOUBLE_EQ(mLambdaCdf(0.7, 1e-13, 0.0, 1.0, false), mLogisticCdf(0.7, 0.0, 1.0, false));
  EXPECT_DOUBLE_EQ(mLambdaInvCdf(0.3, 0.0, 2.0, 3.0), 2.0 + 3.0 * mLogisticInvCdf(0.3, 0.0, 1.0));
  // lambda > 0 ends at +-1/lambda.
  EXPECT_EQ(mLambdaCdf(-0.6, 2.0, 0.0, 1.0, false), 0.0);
  EXPECT_EQ(mLambdaCdf(0.6, 2.0, 0.0, 1.0, false), 1.0);
  EXPECT_EQ(mLambdaCdf(0.6, 2.0, 0.0, 1.0, true), 0.0);
  EXPECT_EQ(mLambdaPdf(0.6, 2.0, 0.0, 1.0), 0.0);
  EXPECT_EQ(mLambdaInvCdf(0.75, 1.0, 0.0, 1.0), 0.5);
  EXPECT_EQ(mLambdaInvCdf(0.75, 2.0, 0.0, 1.0), 0.25);
  // A negative lambda refuses p = 0: the power fails and the prepared
  // missing value is the answer; the search over [0, 1] meets the same end.
  EXPECT_TRUE(isMissing(mLambdaInvCdf(0.0, -0.5, 0.0, 1.0)));
  EXPECT_FALSE(isMissing(mLambdaInvCdf(0.2, -0.5, 0.0, 1.0)));
  // Its distribution function solves Q(p) = x inside (0, 1).
  EXPECT_NEAR(mLambdaCdf(mLambdaInvCdf(0.2, -0.5, 0.0, 1.0), -0.5, 0.0, 1.0, false), 0.2, 1e-12);
  CmLambdaTransform t(0.5, 0.25);
  EXPECT_NEAR(t(0.75), (std::sqrt(0.75) - std::sqrt(0.25)) / 0.5 - 0.25, 1e-15);
}

TEST(DiscreteKernelRules, IntegerRulesAndTails) {
  EXPECT_EQ(mBinomialPdf(2.5, 5, 0.5), 0.0);
  EXPECT_NEAR(mBinomialPdf(2.0 + 1e-13, 5, 0.5), 10.0 / 32.0, 1e-14);
  EXPECT_NEAR(mBinomialCdf(2.0, 5, 0.5, true), 0.8125, 1e-13);
  EXPECT_NEAR(mBinomialCdf(2.0, 5, 0.5, false), 0.5, 1e-13);
  EXPECT_EQ(mBinomialCdf(2.7, 5, 0.5, false), mBinomialCdf(2.0, 5, 0.5, false));
  EXPECT_EQ(mBinomialCdf(-1.0, 5, 0.5, false), 0.0);
  EXPECT_EQ(mBinomialCdf(5.0, 5, 0.5, false), 1.0);
  EXPECT_EQ(mBinomialPdf(0.0, 5, 0.0), 1.0);
  EXPECT_EQ(mBinomialPdf(5.0, 5, 1.0), 1.0);
  EXPECT_EQ(mBinomialPdf(4.0, 5, 1.0), 0.0);
  EXPECT_EQ(mBinomialPdf(6.0, 5, 0.3), 0.0);

  EXPECT_EQ(mPoissonCdf(0.0, 3.0, true), 1.0);
  EXPECT_EQ(mPoissonCdf(-0.5, 3.0, false), 0.0);
  EXPECT_EQ(mPoissonPdf(-1.0, 3.0), 0.0);
  EXPECT_EQ(mPoissonPdf(1.5, 3.0), 0.0);
  EXPECT_EQ(mPoissonCdf(2.0, 0.0, false), 1.0);
  EXPECT_EQ(mPoissonCdf(2.0, 0.0, true), 0.0);
  EXPECT_DOUBLE_EQ(mPoissonCdf(2.9, 3.0, false), mPoissonCdf(2.0, 3.0, false));

  EXPECT_EQ(mNegBinomialPdf(2.0, 0.5, 3.0), 0.0);
  EXPECT_EQ(mNegBinomialPdf(4.0, 0.5, 2.5), 0.0);  // r - 1 not an integer
  EXPECT_DOUBLE_EQ(mNegBinomialPdf(3.0, 0.5, 3.0), 0.125);
  EXPECT_EQ(mNegBinomialCdf(2.0, 0.5, 3.0, false), 0.0);
  EXPECT_EQ(mNegBinomialCdf(3.0, 0.5, 3.0, true), 1.0);
  EXPECT_DOUBLE_EQ(mGeometricPdf(3.0, 0.25), 0.25 * 0.75 * 0.75);
  EXPECT_DOUBLE_EQ(mGeometricCdf(3.0, 0.25, true), 0.75 * 0.75);

  EXPECT_EQ(mHypergeometricPdf(6.0, 20, 7, 5), 0.0);
  EXPECT_EQ(mHypergeometricCdf(-1.0, 20, 7, 5, true), 1.0);
  EXPECT_EQ(mHypergeometricCdf(6.0, 20, 7, 5, false), 1.0);
  EXPECT_EQ(mHypergeometricCdf(6.0, 20, 7, 5, true), 0.0);

  EXPECT_EQ(mIntegerUniformCdf(3.5, 1, 6, false), 0.5);
  EXPECT_EQ(mIntegerUniformCdf(3.5, 1, 6, true), 0.5);
  EXPECT_DOUBLE_EQ(mIntegerUniformCdf(3.0, 1, 6, true), 4.0 / 6.0);
  EXPECT_EQ(mIntegerUniformCdf(0.0, 1, 6, false), 0.0);
  EXPECT_EQ(mIntegerUniformCdf(6.0, 1, 6, false), 1.0);
  EXPECT_DOUBLE_EQ(mIntegerUniformPdf(2.0, 1, 6), 1.0 / 6.0);
  EXPECT_EQ(mIntegerUniformPdf(2.5, 1, 6), 0.0);
  EXPECT_EQ(mIntegerUniformPdf(7.0, 1, 6), 0.0);
}

TEST(DiscreteKernelRules, QuantileEndsAndDegenerateCases) {
  EXPECT_EQ(mPoissonInvCdf(0.0, 3.0), 0.0);
  EXPECT_TRUE(isMissing(mPoissonInvCdf(1.0, 3.0)));
  EXPECT_EQ(mNegBinomialInvCdf(0.1, 0.5, 3.0), 3.0);  // p <= prob^r
  EXPECT_TRUE(isMissing(mNegBinomialInvCdf(1.0, 0.5, 3.0)));
  EXPECT_TRUE(isMissing(mNegBinomialInvCdf(0.5, 0.0, 3.0)));
  EXPECT_EQ(mHypergeometricInvCdf(0.3, 10, 10, 4), 4.0);
  EXPECT_EQ(mHypergeometricInvCdf(0.3, 10, 0, 4), 0.0);
  EXPECT_EQ(mHypergeometricInvCdf(0.3, 10, 6, 10), 6.0);
  EXPECT_EQ(mHypergeometricInvCdf(0.3, 10, 6, 0), 0.0);
  EXPECT_EQ(mHypergeometricInvCdf(0.0, 10, 6, 7), 3.0);
  EXPECT_EQ(mHypergeometricInvCdf(1.0, 10, 6, 7), 6.0);
  EXPECT_EQ(mIntegerUniformInvCdf(0.0, 1, 6), 1.0);
  EXPECT_EQ(mIntegerUniformInvCdf(1.0, 1, 6), 6.0);
  // Every other p: the smallest k with P(X <= k) >= p.
  for (double p = 0.01; p < 1.0; p += 0.0625) {
    const double k = mIntegerUniformInvCdf(p, -3, 8);
    EXPECT_GE(mIntegerUniformCdf(k, -3, 8, false), p);
    EXPECT_LT(mIntegerUniformCdf(k - 1.0, -3, 8, false), p);
  }
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

namespace {

using namespace qel;

TEST(BetaAndTKernelRules, CriticalValuesAndPValues) {
  // Bonferroni over 2 comparisons, two-sided: p = 1 - 0.05/2/2 = 0.9875.
  const double c = mTCritValue(0.05, 10.0, kAlternativeNotEqual, 2);
  EXPECT_NEAR(mTCdf(c, 10.0, 0.0, true), 0.0125, 1e-12);
  EXPECT_NEAR(mTCdf(mTCritValue(0.05, 10.0, kAlternativeLess, 1), 10.0, 0.0, true), 0.05, 1e-12);
  const double sidak = 1.0 - std::pow(0.95, 1.0 / 3.0);
  EXPECT_NEAR(mTCdf(mTSidakCritValue(0.05, 7.0, kAlternativeGreater, 3), 7.0, 0.0, true), sidak,
              1e-12);
  EXPECT_TRUE(mIsNumericMissing(mTCritValue(0.05, 10.0, static_cast<EAlternative>(5), 1)));
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
  EXPECT_TRUE(mIsNumericMissing(mFPValue(mGetMissingValueCode(), 3.0, 4.0, kAlternativeLess)));
  EXPECT_TRUE(mIsNumericMissing(mTPValue(mGetMissingValueCode(), 3.0, kAlternativeLess)));
}

TEST(BetaAndTKernelRules, NoncentralitySpecialCases) {
  // Beyond the routine's limit on the noncentrality, a second try just
  // inside it is accepted when the lower tail is already 0 there.
  EXPECT_EQ(mTCdf(1.0, 10.0, 1e5, false), 0.0);
  EXPECT_EQ(mTCdf(1.0, 10.0, 1e5, true), 1.0);
  EXPECT_TRUE(mIsNumericMissing(mTCdf(1e6, 10.0, 1e5, false)));
  double lower = 0.0, upper = 0.0;
  EXPECT_FALSE(mTCdf(mGetMissingValueCode(), 10.0, 0.0, &lower, &upper));
  EXPECT_TRUE(mTCdf(1.5, 10.0, 0.5, &lower, &upper));
  EXPECT_DOUBLE_EQ(lower, mTCdf(1.5, 10.0, 0.5, false));
  EXPECT_DOUBLE_EQ(upper, mTCdf(1.5, 10.0, 0.5, true));
  // A noncentrality below 2.2250738585072014e-307 is the central F.
  EXPECT_EQ(mFCdf(1.3, 3.0, 8.0, 1e-310, false), mFCdf(1.3, 3.0, 8.0, 0.0, false));
  EXPECT_EQ(mFInvCdf(0.3, 3.0, 8.0, 1e-310), mFInvCdf(0.3, 3.0, 8.0, 0.0));
  // Noncentral t quantiles with no variance (df <= 2) start from a bracket
  // next to the mean.
  for (double df : {1.0, 2.0, 7.0}) {
    for (double p : {0.02, 0.5, 0.97}) {
      const double q = mTInvCdf(p, df, 1.2);
      ASSERT_FALSE(mIsNumericMissing(q)) << df << " " << p;
      EXPECT_NEAR(mTCdf(q, df, 1.2, false), p, 1e-10 * p) << df << " " << p;
    }
  }
  EXPECT_TRUE(mIsNumericMissing(mTInvCdf(0.0, 4.0, 1.0)));
  EXPECT_TRUE(mIsNumericMissing(mTInvCdf(1.0, 4.0, 0.0)));
  EXPECT_EQ(mFInvCdf(0.0, 3.0, 8.0, 2.0), 0.0);
  EXPECT_TRUE(mIsNumericMissing(mFInvCdf(1.0, 3.0, 8.0, 2.0)));
  CmTCdf t(5.0, 0.0, 0.5);
  EXPECT_TRUE(mIsNumericMissing(t(mGetMissingValueCode())));
}

TEST(BetaAndTKernelRules, BetaEndsAndBinomialQuantileEnds) {
  EXPECT_TRUE(mIsNumericMissing(mBetaPdf(0.0, 0.5, 2.0)));
  EXPECT_EQ(mBetaPdf(0.0, 1.0, 2.5), 2.5);
  EXPECT_EQ(mBetaPdf(0.0, 3.0, 2.5), 0.0);
  EXPECT_TRUE(mIsNumericMissing(mBetaPdf(1.0, 2.0, 0.5)));
  EXPECT_EQ(mBetaPdf(1.0, 4.0, 1.0), 4.0);
  EXPECT_EQ(mBetaPdf(1.0, 4.0, 2.0), 0.0);
  EXPECT_EQ(mBetaPdf(1.5, 4.0, 2.0), 0.0);
  EXPECT_EQ(mBetaCdf(0.0, 2.0, 3.0, true), 1.0);
  EXPECT_EQ(mBetaCdf(1.0, 2.0, 3.0, true), 0.0);
  EXPECT_EQ(mBetaCdf(1.0, 2.0, 3.0, false), 1.0);
  EXPECT_EQ(mBetaInvCdf(0.0, 2.0, 3.0), 0.0);
  EXPECT_EQ(mBetaInvCdf(1.0, 2.0, 3.0), 1.0);
  EXPECT_EQ(mBinomialInvCdf(0.0, 12, 0.3), 0.0);
  EXPECT_EQ(mBinomialInvCdf(1.0, 12, 0.3), 12.0);
  // The incomplete beta ratio serves n beyond the integer range: 18.26
  // standard deviations below the mean of a fair binomial on 3e9 trials the
  // tail is close to the normal one, 8e-75.
  const double big = 3e9;
  const double tail = mBinomialCdf(big * 0.5 - 5e5, big, 0.5, false);
  EXPECT_GT(tail, 1e-76);
  EXPECT_LT(tail, 1e-73);
}

}  // namespace
