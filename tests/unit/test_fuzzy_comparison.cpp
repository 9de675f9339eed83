// Comparison within a tolerance and the integer tests built on it.
#include <gtest/gtest.h>

#include <cmath>

#include "utilities/MathUtilities.h"

namespace {

TEST(FuzzyComparison, AbsolutePartNearZero) {
  EXPECT_TRUE(qel::mEqualWithinFuzz(0.0, 0.0, 0.0));
  EXPECT_TRUE(qel::mEqualWithinFuzz(0.0, 1e-30, 0.0));
  EXPECT_FALSE(qel::mEqualWithinFuzz(0.0, 2e-30, 0.0));
  // A scale f widens the absolute part to 1e-14 f.
  EXPECT_TRUE(qel::mEqualWithinFuzz(0.0, 1e-14, 1.0));
  EXPECT_FALSE(qel::mEqualWithinFuzz(0.0, 2e-14, 1.0));
  EXPECT_DOUBLE_EQ(qel::mGetFuzzMax(100.0), 1e-12);
}

TEST(FuzzyComparison, RelativePartAndInclusiveBoundary) {
  EXPECT_TRUE(qel::mEqualWithinFuzz(1.0, 1.0 + 5e-13, 0.0));
  EXPECT_FALSE(qel::mEqualWithinFuzz(1.0, 1.0 + 2e-12, 0.0));
  // |a - b| equal to the tolerance counts as equal.
  EXPECT_EQ(qel::mCompareWithFuzz(0.0, 1e-30, 0.0), 0);
  EXPECT_EQ(qel::mCompareWithFuzz(1.0, 2.0, 0.0), -1);
  EXPECT_EQ(qel::mCompareWithFuzz(2.0, 1.0, 0.0), 1);
  EXPECT_EQ(qel::mCompareWithFuzz(-1e6, -1e6 * (1 + 1e-13), 0.0), 0);
  const double a = 3.0, b = 3.0 + 1e-9, f = 0.0;
  EXPECT_EQ(qel::L_COMPARE_WITH_FUZZ(&a, &b, &f), -1);
  EXPECT_FALSE(qel::L_EQUAL_WITHIN_FUZZ(&a, &b, &f));
}

TEST(FuzzyComparison, ApproxEqualScalesByTheFirstArgumentOnly) {
  EXPECT_FALSE(qel::mApproxEqual(0.0, 1e-5, 1.0, 0.0));
  EXPECT_TRUE(qel::mApproxEqual(1e-5, 0.0, 1.0, 0.0));
  EXPECT_TRUE(qel::mApproxEqual(0.0, 1e-5, 0.0, 1e-5));
  const double a = 0.0, b = 1e-5, rel = 1.0, abs = 0.0;
  EXPECT_FALSE(qel::LEQUAL(&a, &b, &rel, &abs));
}

TEST(NearestInteger, HalvesGoAwayFromZero) {
  EXPECT_EQ(qel::mNearestInteger(-2.5), -3.0);
  EXPECT_EQ(qel::mNearestInteger(2.5), 3.0);
  EXPECT_EQ(qel::mNearestInteger(-2.4), -2.0);
  EXPECT_EQ(qel::mNearestInteger(2.4), 2.0);
  const double x = -0.5;
  EXPECT_EQ(qel::GET_NEAREST_INTEGER(&x), -1.0);
  EXPECT_EQ(qel::GET_FLOOR(&x), -1.0);
  EXPECT_EQ(qel::GET_CEILING(&x), 0.0);
}

TEST(IntegerWithinFuzz, EvenAndIntegerTests) {
  EXPECT_TRUE(qel::mIsIntegerWithinFuzz(3.0 + 1e-13, 0.0));
  EXPECT_FALSE(qel::mIsIntegerWithinFuzz(3.0 + 1e-9, 0.0));
  EXPECT_TRUE(qel::mIsEven(4.0, 0.0));
  EXPECT_TRUE(qel::mIsEven(-4.0 + 1e-13, 0.0));
  EXPECT_FALSE(qel::mIsEven(3.0, 0.0));
  EXPECT_FALSE(qel::mIsEven(4.5, 0.0));
  EXPECT_TRUE(qel::mIsEven(0.0, 0.0));
}

TEST(SignAndModulo, FollowTheCLibrary) {
  EXPECT_TRUE(std::signbit(qel::mTransferSign(2.0, -0.0)));
  EXPECT_EQ(qel::mTransferSign(-2.0, 1.0), 2.0);
  EXPECT_EQ(qel::mModulo(-7.0, 3.0), -1.0);
}

}  // namespace
