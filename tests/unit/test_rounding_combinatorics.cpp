// Rounding, combinatorics, the alternating-series sum and subset enumeration.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <set>
#include <stdexcept>
#include <vector>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"

namespace {

TEST(Rounding, PlacesSignificantDigitsAndMultiples) {
  EXPECT_EQ(qel::mRound(2.345, 2), 2.35);
  EXPECT_EQ(qel::mRound(-2.5, 0), -3.0);
  EXPECT_EQ(qel::mRound(1234.5, -2), 1200.0);
  EXPECT_EQ(qel::mRound(0.0, 2), 0.0);
  EXPECT_TRUE(qel::mIsNumericMissing(qel::mRound(qel::mGetMissingValueCode(), 2)));
  EXPECT_TRUE(qel::mIsNumericMissing(qel::mRound(1e300, 10)));
  EXPECT_TRUE(qel::mIsNumericMissing(qel::mRound(1e-300, -10)));
  EXPECT_EQ(qel::mRoundToSigDigits(123456.0, 2), 120000.0);
  EXPECT_EQ(qel::mRoundToSigDigits(-0.00123456, 3), -0.00123);
  EXPECT_EQ(qel::mRoundToSigDigits(0.0, 3), 0.0);
  EXPECT_EQ(qel::mRoundToMultiple(0.0, 5.0), 0.0);
  EXPECT_EQ(qel::mRoundToMultiple(7.0, 0.0), 7.0);
  EXPECT_DOUBLE_EQ(qel::mRoundToMultiple(13.0, 5.0), 15.0);
  EXPECT_DOUBLE_EQ(qel::mRoundToMultiple(-13.0, 5.0), -15.0);
  EXPECT_DOUBLE_EQ(qel::mRoundToMultiple(13.0, -5.0), 15.0);
}

TEST(Rounding, ScaleByPowerOfTenInChunks) {
  EXPECT_EQ(qel::mScaleByPowerOfTen(1e-300, 600), 1e300);
  EXPECT_EQ(qel::mScaleByPowerOfTen(1e300, -600), 1e-300);
  EXPECT_EQ(qel::mScaleByPowerOfTen(3.0, 0), 3.0);
  EXPECT_EQ(qel::mScaleByPowerOfTen(3.0, 2), 300.0);
}

// Exact binomial coefficients by Pascal's triangle, in 64-bit integers.
std::vector<std::vector<std::uint64_t>> pascal(int rows) {
  std::vector<std::vector<std::uint64_t>> c(rows + 1);
  for (int n = 0; n <= rows; ++n) {
    c[n].assign(n + 1, 1);
    for (int k = 1; k < n; ++k) c[n][k] = c[n - 1][k - 1] + c[n - 1][k];
  }
  return c;
}

TEST(Combinatorics, BinomialCoefficientsAreExactIntegers) {
  const auto c = pascal(34);
  for (int n = 1; n <= 34; ++n) {
    for (int k = 0; k <= n; ++k) {
      // Beyond the int range mNChooseK has no answer and gives 0.
      const std::uint64_t expected = c[n][k] > 2147483647u ? 0 : c[n][k];
      ASSERT_EQ(static_cast<std::uint64_t>(qel::mNChooseK(n, k)), expected) << n << " " << k;
      ASSERT_EQ(qel::mCombinations(n, k), static_cast<double>(c[n][k]));
    }
  }
  EXPECT_EQ(qel::mNChooseK(5, 2), 10);
  EXPECT_EQ(qel::mLogNChooseK(0, 7), 0.0);
  const unsigned n = 6, k = 3;
  EXPECT_EQ(qel::N_CHOOSE_K(&n, &k), 20);
  // k > n reaches the gamma function at a non-positive argument.
  EXPECT_THROW(qel::mNChooseK(3, 5), std::invalid_argument);
  // Overflow of the exponential is caught: no answer, 0.
  EXPECT_EQ(qel::mNChooseK(2000, 1000), 0);
}

TEST(Combinatorics, FactorialsAndPermutations) {
  EXPECT_EQ(qel::mNFactorial(0), 1);
  EXPECT_EQ(qel::mNFactorial(12), 479001600);
  EXPECT_EQ(qel::mNFactorial(13), 0);  // above the largest integer
  EXPECT_EQ(qel::mNFactorial(200), 0);  // the exponential overflows
  EXPECT_EQ(qel::mPermutations(10.0, 3.0), 720.0);
  EXPECT_EQ(qel::mPermutations(9.6, 3.4), 720.0);  // both rounded first
  EXPECT_EQ(qel::mCombinations(52.0, 5.0), 2598960.0);
}

class SignedTerm : public qel::CmAlternateSeriesTerm {
 public:
  explicit SignedTerm(double (*f)(int)) : mF(f) {}
  double operator()(int k) override {
    ++calls;
    return mF(k);
  }
  int calls = 0;

 private:
  double (*mF)(int);
};

TEST(AlternateSeries, EulerTransformationConvergesFast) {
  // ln 2 = 1 - 1/2 + 1/3 - ...: the plain partial sums need 10^12 terms for
  // this accuracy; the transformation needs a few dozen.
  SignedTerm log2([](int k) { return (k % 2 ? -1.0 : 1.0) / (k + 1); });
  EXPECT_NEAR(qel::mAlternateSeriesSum(0, log2), std::log(2.0), 1e-12);
  EXPECT_LT(log2.calls, 60);
  SignedTerm leibniz([](int k) { return (k % 2 ? -1.0 : 1.0) / (2 * k + 1); });
  EXPECT_NEAR(qel::mAlternateSeriesSum(0, leibniz), M_PI / 4, 1e-12);
  // Starting later skips the first terms: pi/4 - 1.
  SignedTerm tail([](int k) { return (k % 2 ? -1.0 : 1.0) / (2 * k + 1); });
  EXPECT_NEAR(qel::mAlternateSeriesSum(1, tail), M_PI / 4 - 1.0, 1e-12);
  EXPECT_EQ(log2.mGetTolerance(), 1e-12);
}

TEST(Subsets, WithoutReplacementInLexicographicOrder) {
  qel::CmSubsetsOfNChooseK subsets;
  ASSERT_EQ(subsets.mInitialize(4, 2), 6);
  const std::vector<std::vector<int>> expected = {{0, 1}, {0, 2}, {0, 3},
                                                  {1, 2}, {1, 3}, {2, 3}};
  std::vector<int> out;
  for (const auto& e : expected) {
    subsets.mNextSubset(out);
    EXPECT_EQ(out, e);
  }
  out = {9};
  subsets.mNextSubset(out);
  EXPECT_EQ(out, std::vector<int>{9});  // exhausted: out left alone
  // A copy continues from where the original stood.
  qel::CmSubsetsOfNChooseK a;
  a.mInitialize(5, 3);
  a.mNextSubset(out);
  qel::CmSubsetsOfNChooseK b = a;
  std::vector<int> fromA, fromB;
  a.mNextSubset(fromA);
  b.mNextSubset(fromB);
  EXPECT_EQ(fromA, fromB);
  EXPECT_EQ(fromA, (std::vector<int>{0, 1, 3}));
}

TEST(Subsets, WithReplacementConstantOnesFirst) {
  qel::CmSubsetsOfNChooseKWithReplacement multisets;
  ASSERT_EQ(multisets.mInitialize(2, 2), 3);
  std::vector<int> out;
  multisets.mNextSubset(out);
  EXPECT_EQ(out, (std::vector<int>{0, 0}));
  multisets.mNextSubset(out);
  EXPECT_EQ(out, (std::vector<int>{1, 1}));
  multisets.mNextSubset(out);
  EXPECT_EQ(out, (std::vector<int>{0, 1}));

  // n = 4, k = 3: all 20 multisets, each once, constant ones first.
  ASSERT_EQ(multisets.mInitialize(4, 3), 20);
  std::set<std::vector<int>> seen;
  std::vector<std::vector<int>> order;
  for (int i = 0; i < 20; ++i) {
    multisets.mNextSubset(out);
    ASSERT_TRUE(std::is_sorted(out.begin(), out.end()));
    seen.insert(out);
    order.push_back(out);
  }
  EXPECT_EQ(seen.size(), 20u);
  for (int i = 0; i < 4; ++i) EXPECT_EQ(order[i], std::vector<int>(3, i));
  EXPECT_TRUE(std::is_sorted(order.begin() + 4, order.end()));
}

}  // namespace
