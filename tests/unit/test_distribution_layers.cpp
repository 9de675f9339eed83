// The inner layers v0 (argument checks, armed frame) and v1 (bare frame,
// NaN on failure) of the distribution functions.
#include <gtest/gtest.h>
#include <qel/distributions.h>

#include <cmath>
#include <limits>

#include "fpu_state.h"
#include "interfaces/math/random_distributions_v0.h"
#include "interfaces/math/random_distributions_v1.h"
#include "interfaces/math/transcendental_v1.h"
#include "reference_data.h"

namespace {

const double kInf = std::numeric_limits<double>::infinity();
const double kNaN = std::numeric_limits<double>::quiet_NaN();

TEST(DistributionLayerV0, ChecksArgumentsBeforeTheFrame) {
  EXPECT_EQ(qel::v0::NormalPValue(kInf, qel::kAlternativeNotEqual), 0.0);
  EXPECT_EQ(qel::v0::NormalPValue(-kInf, qel::kAlternativeLess), 0.0);
  EXPECT_TRUE(std::isnan(qel::v0::NormalPValue(kNaN, qel::kAlternativeLess)));
  EXPECT_EQ(qel::v0::TPValue(kInf, 5.0, qel::kAlternativeNotEqual), 0.0);
  EXPECT_TRUE(std::isnan(qel::v0::TPValue(1.0, kNaN, qel::kAlternativeNotEqual)));
  // Infinitely many degrees of freedom: the normal law.
  EXPECT_EQ(qel::v0::TPValue(1.5, kInf, qel::kAlternativeGreater),
            qel::NormalPValue(1.5, qel::kAlternativeGreater));
  EXPECT_TRUE(std::isnan(qel::v0::NormalInvCdf(kInf, 0.0, 1.0)));
  EXPECT_TRUE(std::isnan(qel::v0::TInvCdf(0.5, kInf, 0.0)));
  EXPECT_TRUE(std::isnan(qel::v0::TCritValue(kNaN, 4.0, qel::kAlternativeNotEqual)));
  EXPECT_TRUE(qeltest::isDefaultState());
}

TEST(DistributionLayerV0, CriticalValuesAndQuantileObjects) {
  // Quantiles from mpmath: z(0.975) and t(0.975; 10); the ELV routes are
  // good to about 1e-9 relative.
  EXPECT_NEAR(qel::v0::NormalCritValue(0.05, qel::kAlternativeNotEqual), 1.959963984540054, 2e-9);
  EXPECT_EQ(qel::v0::NormalCritValue(0.05, qel::kAlternativeLess),
            qel::v0::NormalCritValue(0.05, qel::kAlternativeGreater));
  EXPECT_NEAR(qel::v0::TCritValue(0.05, 10.0, qel::kAlternativeNotEqual), 2.228138851986275, 1e-9);
  EXPECT_NEAR(qel::v0::TInvCdfFunc(10.0)(0.975), 2.228138851986275, 1e-9);
  EXPECT_NEAR(qel::v0::NormalInvCdfFunc()(0.975), 1.959963984540054, 2e-9);
  EXPECT_TRUE(std::isnan(qel::v0::TInvCdfFunc(kInf)(0.975)));
  EXPECT_EQ(qel::v0::BinomialPValue(5.0, 10u, 0.5, qel::kAlternativeNotEqual), 1.0);
}

TEST(DistributionLayerV1, PValuesAndBadAlternatives) {
  EXPECT_TRUE(std::isnan(qel::v1::NormalPValue(kInf, qel::kAlternativeNotEqual)));
  EXPECT_EQ(qel::v1::NormalPValue(1.0, static_cast<qel::AlternativeHypothesis>(7)), -2.0);
  EXPECT_EQ(qel::NormalPValue(1.0, static_cast<qel::EAlternative>(7)), 0.0);
  EXPECT_EQ(qel::v1::NormalPValue(0.0, qel::kAlternativeNotEqual), 1.0);
  EXPECT_EQ(qel::v1::ChiSqPValue(-1.0, 3.0, qel::kAlternativeGreater), 1.0);
  EXPECT_EQ(qel::v1::ChiSqPValue(2.0, 3.0, static_cast<qel::AlternativeHypothesis>(-4)), -2.0);
  EXPECT_NEAR(qel::v1::ChiSqPValue(7.814727903251178, 3.0, qel::kAlternativeGreater), 0.05, 1e-12);
  EXPECT_EQ(qel::v1::NormalCdf(2.0, 2.0, 1.0, true), 0.5);
  EXPECT_TRUE(std::isnan(qel::v1::NormalCdf(kNaN, 0.0, 1.0, false)));
  EXPECT_NEAR(qel::v1::NormalInvCdf(0.975, 1.0, 2.0), 1.0 + 2 * 1.959963984540054, 1e-8);
}

TEST(DistributionLayerV1, DiscreteRulesAndUpperTails) {
  EXPECT_EQ(qel::v1::BinomialPdf(2.5, 5u, 0.5), 0.0);
  // 2^-50 relative: 1e6 + 1e-10 counts as the integer, 2 + 1e-13 does not.
  EXPECT_GT(qel::v1::BinomialPdf(1e6 + 1e-10, 2000000u, 0.5), 0.0);
  EXPECT_EQ(qel::v1::BinomialPdf(2.0 + 1e-13, 5u, 0.5), 0.0);
  EXPECT_EQ(qel::v1::BinomialPdf(0.0, 5u, 0.0), 1.0);
  EXPECT_EQ(qel::v1::BinomialPdf(5.0, 5u, 1.0), 1.0);
  EXPECT_NEAR(qel::v1::BinomialCdf(2.0, 5u, 0.5, true), 0.8125, 1e-9);
  EXPECT_NEAR(qel::v1::BinomialCdf(2.0, 5u, 0.5, false), 0.5, 1e-9);
  EXPECT_EQ(qel::v1::BinomialCdf(5.0, 5u, 0.3, false), 1.0);
  EXPECT_EQ(qel::v1::BinomialInvCdf(0.0, 9u, 0.3), 0.0);
  EXPECT_EQ(qel::v1::BinomialInvCdf(1.0, 9u, 0.3), 9.0);
  // Hypergeometric: N = 20, M = 7, n = 5; the support is 0..5.
  const double lower = qel::v1::HypergeometricCdf(2.0, 20u, 7u, 5u, false);
  const double upper = qel::v1::HypergeometricCdf(2.0, 20u, 7u, 5u, true);
  EXPECT_NEAR(lower + upper, 1.0 + qel::v1::HypergeometricPdf(2.0, 20u, 7u, 5u), 1e-12);
  EXPECT_EQ(qel::v1::HypergeometricCdf(6.0, 20u, 7u, 5u, false), 1.0);
  EXPECT_EQ(qel::v1::HypergeometricInvCdf(0.3, 20u, 20u, 5u), 5.0);
  EXPECT_EQ(qel::v1::HypergeometricInvCdf(0.3, 20u, 0u, 5u), 0.0);
  EXPECT_EQ(qel::v1::HypergeometricInvCdf(0.0, 20u, 17u, 5u), 2.0);
  EXPECT_TRUE(std::isnan(
      qel::v1::HypergeometricPValue(2u, 20u, 7u, 5u, static_cast<qel::AlternativeHypothesis>(3))));
  EXPECT_EQ(qel::v1::WeibullInvCdf(1.0, 2.0, 3.0, 0.0), kInf);
  EXPECT_EQ(qel::v1::WeibullInvCdf(0.0, 2.0, 3.0, -1.0), -1.0);
  EXPECT_TRUE(std::isnan(qel::v1::WeibullInvCdf(1.5, 2.0, 3.0, 0.0)));
  EXPECT_TRUE(std::isnan(qel::v1::BetaPdf(0.0, 0.5, 2.0)));
  EXPECT_EQ(qel::v1::BetaPdf(0.0, 1.0, 2.5), 2.5);
  EXPECT_EQ(qel::v1::BetaPdf(1.0, 3.0, 1.0), 3.0);
  EXPECT_EQ(qel::v1::BetaInvCdf(1.0, 3.0, 1.0), 1.0);
  EXPECT_TRUE(std::isnan(qel::v1::BetaInvCdf(-0.1, 3.0, 1.0)));
}

TEST(DistributionLayerV1, FisherExactTestAgainstEnumeration) {
  // Two-sided: the sum of the point probabilities not above that of x.
  for (unsigned x = 0; x <= 5; ++x) {
    const double at = qel::v1::HypergeometricPdf(x, 20u, 7u, 5u);
    double expected = 0.0;
    for (unsigned y = 0; y <= 5; ++y) {
      const double py = qel::v1::HypergeometricPdf(y, 20u, 7u, 5u);
      if (py <= at * (1 + 1e-12)) expected += py;
    }
    const double p = qel::v1::HypergeometricPValue(x, 20u, 7u, 5u, qel::kAlternativeNotEqual);
    if (expected > 1.0 - 1e-12) {
      EXPECT_EQ(p, 1.0) << x;  // the mode
    } else {
      EXPECT_NEAR(p, expected, 1e-12) << x;
    }
  }
}

TEST(DistributionLayerV1, HelpersAtTheirEdges) {
  EXPECT_EQ(qel::v1::LogGamma(1.0), 0.0);
  EXPECT_EQ(qel::v1::LogGamma(2.0), 0.0);
  EXPECT_TRUE(std::isnan(qel::v1::LogGamma(0.0)));
  EXPECT_TRUE(std::isnan(qel::v1::LogGamma(1e-16)));  // lost against 7
  EXPECT_EQ(qel::v1::NearestInteger(-2.5), -3.0);
  EXPECT_EQ(qel::v1::NearestInteger(2.5), 3.0);
  EXPECT_EQ(qel::v1::CopySign(-1.0, 3.0), -3.0);  // sign first, magnitude second
  EXPECT_EQ(qel::v1::CopySign(2.0, -3.0), 3.0);
  EXPECT_TRUE(qel::v1::TheseAreAlmostEqual(0.0, 0.0));
  EXPECT_TRUE(qel::v1::TheseAreAlmostEqual(1.0, 1.0 + 1e-16));
  EXPECT_FALSE(qel::v1::TheseAreAlmostEqual(1.0, 1.0 + 1e-14));
  EXPECT_EQ(qel::v1::LogNChooseK(0u, 0u), 0.0);
  EXPECT_EQ(qel::v1::LogNChooseK(0u, 1u), -kInf);
  EXPECT_EQ(qel::v1::LogNChooseK(3u, 5u), -kInf);
}

TEST(DistributionLayerV1, OwnFormulasMatchMpmath) {
  const auto rows = qeltest::loadReferenceData("v1_formulas.csv", 1);
  for (const auto& row : rows) {
    const std::string& f = row.text[0];
    const double* v = row.numbers.data();
    double actual;
    if (f == "BetaPdf") {
      actual = qel::v1::BetaPdf(v[0], v[1], v[2]);
    } else if (f == "BinomialPdf") {
      actual = qel::v1::BinomialPdf(v[0], static_cast<unsigned>(v[1]), v[2]);
    } else if (f == "HypergeometricPdf") {
      actual = qel::v1::HypergeometricPdf(v[0], static_cast<unsigned>(v[1]),
                                          static_cast<unsigned>(v[2]), static_cast<unsigned>(v[3]));
    } else if (f == "WeibullInvCdf") {
      actual = qel::v1::WeibullInvCdf(v[0], v[1], v[2], v[3]);
    } else if (f == "LogGamma") {
      actual = qel::v1::LogGamma(v[0]);
    } else {
      ASSERT_EQ(f, "LogNChooseK");
      actual = qel::v1::LogNChooseK(static_cast<unsigned>(v[0]), static_cast<unsigned>(v[1]));
    }
    // The Lanczos log-gamma is good to about 1e-14; the densities built on it
    // lose a little more in the exponential of large logarithms.
    EXPECT_LE(qeltest::relativeError(actual, v[4]), 1e-11)
        << f << " at line " << row.line << ": " << actual << " vs " << v[4];
  }
}

}  // namespace
