// Checked elementary functions at the edges of their domains and limits.
#include <gtest/gtest.h>

#include <cfloat>
#include <cmath>
#include <stdexcept>
#include <string>

#include "utilities/LYNBasicTypes.h"
#include "utilities/CheckedFunctions.h"

namespace {

template <class E, class F>
std::string messageOf(F f) {
  try {
    f();
  } catch (const E& e) {
    return e.what();
  }
  return "<no exception>";
}

TEST(CheckedSqrt, NegativeZeroIsNotNegative) {
  EXPECT_TRUE(std::signbit(qel::mSqrt(-0.0, true)));
  EXPECT_EQ(qel::mSqrt(-0.0, true), 0.0);
  EXPECT_EQ(qel::mSqrt(4.0, true), 2.0);
  EXPECT_EQ(qel::mSqrt(-1e-300, false), 0.0);
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mSqrt(-1e-300, true); }),
            "sqrt of a negative argument");
}

TEST(CheckedExponential, LimitsOnBothSides) {
  EXPECT_EQ(qel::mExponential(-800.0, true), 0.0);
  EXPECT_EQ(qel::mExponential(-800.0, false), 0.0);
  EXPECT_TRUE(std::isfinite(qel::mExponential(709.7827128933839, true)));
  EXPECT_EQ(qel::mExponential(709.8, false), DBL_MAX);
  EXPECT_EQ(messageOf<std::runtime_error>([] { qel::mExponential(709.8, true); }),
            "float overflow");
  EXPECT_DOUBLE_EQ(qel::mExponential(1.0, true), std::exp(1.0));
}

TEST(CheckedLog, ZeroAndNegativeArguments) {
  EXPECT_EQ(qel::mLog(0.0, false), -DBL_MAX);
  EXPECT_EQ(messageOf<std::runtime_error>([] { qel::mLog(0.0, true); }), "float overflow");
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mLog(-1.0, false); }),
            "log of a negative argument");
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mLog(-1.0, true); }),
            "log of a negative argument");
  EXPECT_TRUE(qel::mIsNumericMissing(qel::mLog10(0.0, false)));
  EXPECT_TRUE(qel::mIsNumericMissing(qel::mLog10(-1.0, false)));
  EXPECT_EQ(messageOf<std::runtime_error>([] { qel::mLog10(0.0, true); }), "float overflow");
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mLog10(-2.0, true); }),
            "log of a negative argument");
  EXPECT_EQ(qel::mLog10(1000.0, true), 3.0);
}

TEST(CheckedPower, ZeroBase) {
  EXPECT_EQ(qel::mRaiseToPower(0.0, 0.0, true), 1.0);
  EXPECT_EQ(qel::mRaiseToPower(0.0, 2.0, true), 0.0);
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mRaiseToPower(0.0, -1.0, false); }),
            "zero raised to a negative power");
}

TEST(CheckedPower, PositiveBaseUsesTheExponentLimit) {
  EXPECT_TRUE(std::isfinite(qel::mRaiseToPower(qel::mGetE(), 709.0, true)));
  EXPECT_THROW(qel::mRaiseToPower(qel::mGetE(), 710.0, true), std::runtime_error);
  EXPECT_EQ(qel::mRaiseToPower(qel::mGetE(), 710.0, false), DBL_MAX);
  EXPECT_EQ(qel::mRaiseToPower(10.0, -400.0, true), 0.0);
  EXPECT_EQ(qel::mRaiseToPower(2.0, 10.0, true), 1024.0);
}

TEST(CheckedPower, NegativeBaseNeedsAnIntegerPower) {
  EXPECT_EQ(qel::mRaiseToPower(-2.0, 3.0, true), -8.0);
  EXPECT_EQ(qel::mRaiseToPower(-2.0, 2.0, true), 4.0);
  // Within the fuzz the power counts as the integer it is close to.
  EXPECT_EQ(qel::mRaiseToPower(-2.0, 3.0 + 1e-13, true), -8.0);
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mRaiseToPower(-2.0, 0.5, false); }),
            "negative number raised to a noninteger power");
  EXPECT_EQ(qel::mRaiseToPower(-10.0, 401.0, false), -DBL_MAX);
  EXPECT_EQ(qel::mRaiseToPower(-10.0, 400.0, false), DBL_MAX);
  EXPECT_THROW(qel::mRaiseToPower(-10.0, 401.0, true), std::runtime_error);
  EXPECT_EQ(qel::mRaiseToPower(-10.0, -401.0, true), 0.0);
}

TEST(CheckedTrig, ArgumentLimitAppliesToAllFour) {
  EXPECT_DOUBLE_EQ(qel::mSin(823549.0), std::sin(823549.0));
  EXPECT_DOUBLE_EQ(qel::mCos(-823549.0), std::cos(-823549.0));
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mSin(823549.5); }),
            "argument out of range for trig functions");
  EXPECT_THROW(qel::mCos(-823549.5), std::invalid_argument);
  EXPECT_THROW(qel::mTan(1e6), std::invalid_argument);
  EXPECT_THROW(qel::mATan(1e6), std::invalid_argument);
  EXPECT_DOUBLE_EQ(qel::mATan(1.0), qel::mGetPi() / 4);
}

TEST(CheckedInverseTrig, EndsAreSnappedAndOutsideIsMissing) {
  EXPECT_TRUE(qel::mIsNumericMissing(qel::mASin(1.0 + 1e-13)));
  EXPECT_EQ(qel::mASin(1.0 - 1e-13), qel::mGetPi() / 2);
  EXPECT_EQ(qel::mASin(-1.0 + 1e-13), -qel::mGetPi() / 2);
  EXPECT_TRUE(qel::mIsNumericMissing(qel::mACos(-1.5)));
  EXPECT_EQ(qel::mACos(1e-13), qel::mGetPi() / 2);
  EXPECT_EQ(qel::mACos(-1e-13), qel::mGetPi() / 2);
  EXPECT_DOUBLE_EQ(qel::mACos(0.5), std::acos(0.5));
  EXPECT_DOUBLE_EQ(qel::mASin(0.5), std::asin(0.5));
}

TEST(AngleConversion, RoundTrip) {
  EXPECT_EQ(qel::mDegreesToRadians(180.0), qel::mGetPi());
  EXPECT_EQ(qel::mRadiansToDegrees(qel::mGetPi()), 180.0);
}

}  // namespace
