// Two-sided binomial (likelihood-ratio ordering) and hypergeometric (Fisher's
// probability ordering) P-values against enumeration of every outcome in
// exact rational arithmetic (tests/data/kernels_pvalues.csv, written by
// tools/reference/gen_kernels.py). The data cross the symmetric p = 1/2 rule,
// the mode, the mirror to the lower side, the search for the far cut-off and
// the case with no far outcome as extreme; the symmetric tables have exact
// ties in probability, which the kernel judges with mApproxEqual.
#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <string>

#include "reference_data.h"
#include "utilities/distributions/kernels.h"
#include "utilities/LYNBasicTypes.h"

namespace {

// Both sums rest on ELV tails.
constexpr double kBinomialTolerance = 1e-9;
constexpr double kHypergeometricTolerance = 1e-9;

TEST(KernelPValues, TwoSidedMatchExactEnumeration) {
  const auto rows = qeltest::loadReferenceData("kernels_pvalues.csv", 1);
  ASSERT_FALSE(rows.empty());
  std::map<std::string, int> checked;
  std::map<std::string, double> worst;
  for (const auto& row : rows) {
    const std::string& family = row.text[0];
    const double x = row.numbers[0];
    const double expected = row.numbers[5];
    double actual, tolerance;
    if (family == "binomial") {
      actual = qel::mBinomialPValue(x, static_cast<int>(row.numbers[1]), row.numbers[2],
                                    qel::kAlternativeNotEqual);
      tolerance = kBinomialTolerance;
    } else {
      ASSERT_EQ(family, "hypergeometric") << "line " << row.line;
      actual = qel::mHypergeometricPValue(
          static_cast<int>(x), static_cast<int>(row.numbers[1]), static_cast<int>(row.numbers[2]),
          static_cast<int>(row.numbers[3]), qel::kAlternativeNotEqual);
      tolerance = kHypergeometricTolerance;
    }
    const double error = qeltest::relativeError(actual, expected);
    worst[family] = std::fmax(worst[family], error);
    ++checked[family];
    EXPECT_LE(error, tolerance) << family << " x=" << x << " " << row.numbers[1] << " "
                                << row.numbers[2] << " " << row.numbers[3] << " got " << actual
                                << " expected " << expected << " (line " << row.line << ")";
  }
  for (const auto& entry : worst) {
    std::printf("  %-16s %4d cases, largest relative error %.3g\n", entry.first.c_str(),
                checked[entry.first], entry.second);
  }
  EXPECT_GT(checked["binomial"], 50);
  EXPECT_GT(checked["hypergeometric"], 50);
}

TEST(KernelPValues, OneSidedAndOtherAlternatives) {
  using namespace qel;
  // P(X <= 2) and P(X >= 2) for n = 5, p = 1/2: 16/32 and 26/32.
  EXPECT_NEAR(mBinomialPValue(2.0, 5, 0.5, kAlternativeLess), 0.5, 1e-13);
  EXPECT_NEAR(mBinomialPValue(2.0, 5, 0.5, kAlternativeGreater), 0.8125, 1e-13);
  EXPECT_EQ(mBinomialPValue(5.0, 10, 0.5, kAlternativeNotEqual), 1.0);
  EXPECT_EQ(mBinomialPValue(3.0, 10, 0.3, kAlternativeNotEqual), 1.0);  // k/n = p
  EXPECT_EQ(mBinomialPValue(3.0, 10, 0.5, static_cast<EAlternative>(7)), 0.0);
  // Hypergeometric N = 20, M = 7, n = 5: the mode (floor(8*6/22) = 2) is 1.0;
  // the one-sided values are the tails that include the point.
  EXPECT_EQ(mHypergeometricPValue(2, 20, 7, 5, kAlternativeNotEqual), 1.0);
  EXPECT_DOUBLE_EQ(mHypergeometricPValue(1, 20, 7, 5, kAlternativeLess),
                   mHypergeometricCdf(1.0, 20, 7, 5, false));
  EXPECT_DOUBLE_EQ(mHypergeometricPValue(1, 20, 7, 5, kAlternativeGreater),
                   mHypergeometricCdf(1.0, 20, 7, 5, true));
  EXPECT_TRUE(mIsNumericMissing(mHypergeometricPValue(1, 20, 7, 5, static_cast<EAlternative>(2))));
}

}  // namespace
