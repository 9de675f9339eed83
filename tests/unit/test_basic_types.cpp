// Constants (by their exact bits), markers, integer tests and conversions.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <cstring>
#include <limits>
#include <vector>

#include "utilities/LYNBasicTypes.h"

namespace {

std::uint64_t bitsOf(double x) {
  std::uint64_t b;
  std::memcpy(&b, &x, sizeof b);
  return b;
}

TEST(Constants, HaveTheirExactBitPatterns) {
  EXPECT_EQ(bitsOf(qel::mGetMissingValueCode()), 0x462F2A2831AE5ED5ULL);
  EXPECT_EQ(bitsOf(qel::mGetUndefinedCode()), 0xC62F2689C074B614ULL);
  EXPECT_EQ(bitsOf(qel::mGetMaxDataValue()), 0x43ABC88864985500ULL);
  EXPECT_EQ(bitsOf(qel::mGetMaxInteger()), 0x41DFFE27B0000000ULL);
  EXPECT_EQ(bitsOf(qel::mGetNearlyZero()), 0x39B4484BFEEBC2A0ULL);
  EXPECT_EQ(bitsOf(qel::mGetEps(false)), 0x3D719799812DEA11ULL);
  EXPECT_EQ(bitsOf(qel::mGetEps(true)), 0x3CD0000000000000ULL);
  EXPECT_EQ(bitsOf(qel::mGetNewEps()), 0x3CD0000000000000ULL);
  EXPECT_EQ(bitsOf(qel::mGetMaxTrigArg()), 0x412921FA00000000ULL);
  EXPECT_EQ(bitsOf(qel::mGetMaxExponent()), 0x40862E42FEFA39EEULL);
  EXPECT_EQ(bitsOf(qel::mGetPi()), 0x400921FB54442D18ULL);
  EXPECT_EQ(bitsOf(qel::mGetE()), 0x4005BF0A8B145769ULL);
  EXPECT_EQ(bitsOf(qel::mGetEulerConst()), 0x3FE2788CFC6FB619ULL);
  // The decimal meanings, so that a wrong bit pattern cannot pass unnoticed.
  EXPECT_EQ(qel::mGetMissingValueCode(), 1.23456e30);
  EXPECT_EQ(qel::mGetEps(false), 1e-12);
  EXPECT_EQ(qel::mGetMaxInteger(), 2147000000.0);
  EXPECT_EQ(qel::mGetEps(true), std::ldexp(1.0, -50));
}

TEST(Constants, PerUnitExponentLimitCannotOverflow) {
  EXPECT_EQ(qel::MAX_EXPONENT, qel::mGetMaxExponent());
  EXPECT_EQ(qel::XEXP, qel::MAX_EXPONENT);
  EXPECT_TRUE(std::isfinite(std::exp(qel::MAX_EXPONENT)));
  // One ulp below the decimal 709.782712893384 it was made from.
  EXPECT_EQ(std::nextafter(qel::MAX_EXPONENT, 1000.0), 709.782712893384);
}

TEST(Markers, MissingValueAndNaNNeverStandForEachOther) {
  const double nan = std::numeric_limits<double>::quiet_NaN();
  const double inf = std::numeric_limits<double>::infinity();
  EXPECT_FALSE(qel::mIsNumericMissing(nan));
  EXPECT_FALSE(qel::IsResultNA(1.23456e30));
  EXPECT_TRUE(qel::mIsNumericMissing(1.23456e30));
  EXPECT_TRUE(qel::IsResultNA(nan));
  EXPECT_TRUE(qel::IsNaN(nan));
  EXPECT_TRUE(qel::IsInfinity(-inf));
  EXPECT_TRUE(qel::IsPlusInfinity(inf));
  EXPECT_FALSE(qel::IsPlusInfinity(-inf));
  EXPECT_TRUE(qel::IsMinusInfinity(-inf));
  EXPECT_FALSE(qel::IsMinusInfinity(inf));
  EXPECT_FALSE(qel::IsInfinity(1e308));
  EXPECT_EQ(bitsOf(qel::mQuietNaN()), 0x7FF8000000000000ULL);
}

TEST(IntegerTests, RespectTheRoundLimitAndFractions) {
  EXPECT_TRUE(qel::mIsInteger(2147000000.0));
  EXPECT_FALSE(qel::mIsInteger(2147000001.0));
  EXPECT_TRUE(qel::mIsInteger(-2147000000.0));
  EXPECT_FALSE(qel::mIsInteger(-2147000001.0));
  EXPECT_TRUE(qel::mIsInteger(-3.0));
  EXPECT_FALSE(qel::mIsInteger(-3.5));
  EXPECT_TRUE(qel::mIsInteger(-0.0));
  EXPECT_FALSE(qel::mIsInteger(std::numeric_limits<double>::quiet_NaN()));
  EXPECT_FALSE(qel::mIsInteger(std::numeric_limits<double>::infinity()));
}

TEST(Conversions, TruncateAndKeepTheLow32Bits) {
  EXPECT_EQ(qel::mToINTG(-2.9), -2);
  EXPECT_EQ(qel::mToINTG(2.9), 2);
  EXPECT_EQ(qel::mToINTG(7u), 7);
  EXPECT_EQ(qel::mToUINTG(4294967295.0), 4294967295u);
  EXPECT_EQ(qel::mToUINTG(3.99), 3u);
  std::vector<int> to = {9, 9, 9, 9};
  qel::mToINTG(std::vector<double>{1.5, -1.5}, to);
  EXPECT_EQ(to, (std::vector<int>{1, -1}));
}

TEST(Conversions, AlternativeAndConfidenceAreMirrorImages) {
  EXPECT_EQ(qel::mAlternativeFromConfidence(qel::kConfidenceLowerSide), qel::kAlternativeGreater);
  EXPECT_EQ(qel::mAlternativeFromConfidence(qel::kConfidenceUpperSide), qel::kAlternativeLess);
  EXPECT_EQ(qel::mAlternativeFromConfidence(qel::kConfidenceTwoSided), qel::kAlternativeNotEqual);
  EXPECT_EQ(qel::mAlternativeFromConfidence(5), qel::kAlternativeNotEqual);
  EXPECT_EQ(qel::mAlternativeFromConfidence(-1), qel::kAlternativeGreater);
  EXPECT_EQ(qel::mConfidenceFromAlternative(qel::kAlternativeGreater), qel::kConfidenceLowerSide);
  EXPECT_EQ(qel::mConfidenceFromAlternative(qel::kAlternativeLess), qel::kConfidenceUpperSide);
  EXPECT_EQ(qel::mConfidenceFromAlternative(static_cast<qel::EAlternative>(3)),
            qel::kConfidenceTwoSided);
}

TEST(Conversions, NonFiniteValuesBecomeMissing) {
  const double nan = std::numeric_limits<double>::quiet_NaN();
  const double inf = std::numeric_limits<double>::infinity();
  std::vector<double> v = {nan, inf, 1.0, -inf};
  EXPECT_EQ(qel::mConvertInfinityAndNaNToMissing(v), 3);
  EXPECT_TRUE(qel::mIsNumericMissing(v[0]));
  EXPECT_TRUE(qel::mIsNumericMissing(v[1]));
  EXPECT_EQ(v[2], 1.0);
  EXPECT_TRUE(qel::mIsNumericMissing(v[3]));
  EXPECT_TRUE(qel::mIsNumericMissing(qel::mConvertInfinityAndNaNToMissing(nan)));
  EXPECT_EQ(qel::mConvertInfinityAndNaNToMissing(-2.5), -2.5);
}

}  // namespace
