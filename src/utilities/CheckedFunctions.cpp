#include "utilities/CheckedFunctions.h"

#include <cfloat>
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"

namespace qel {

namespace {

const char* const kFloatOverflow = "float overflow";
const char* const kLogOfNegative = "log of a negative argument";
const char* const kTrigRange = "argument out of range for trig functions";

double mHandleOverflow(bool throwOnError) {
  if (throwOnError) throw std::runtime_error(kFloatOverflow);
  return DBL_MAX;
}

double checkedTrigArgument(double x) {
  if (std::fabs(x) > mGetMaxTrigArg()) throw std::invalid_argument(kTrigRange);
  return x;
}

}  // namespace

double mSqrt(double x, bool throwOnError) {
  if (x < 0.0) {
    if (throwOnError) throw std::invalid_argument("sqrt of a negative argument");
    return 0.0;
  }
  return std::sqrt(x);
}

double mExponential(double x, bool throwOnError) {
  if (x > MAX_EXPONENT) {
    if (throwOnError) throw std::runtime_error(kFloatOverflow);
    return DBL_MAX;
  }
  // Below -limit the result is 0 in both modes, so no underflow reaches the
  // processor.
  if (x < -MAX_EXPONENT) return 0.0;
  return std::exp(x);
}

// A NaN argument passes through to the C library and comes back NaN.
double mLog(double x, bool throwOnError) {
  if (!(x <= 0.0)) return std::log(x);
  if (x < 0.0) throw std::invalid_argument(kLogOfNegative);
  if (throwOnError) throw std::runtime_error(kFloatOverflow);
  return -DBL_MAX;
}

double mLog10(double x, bool throwOnError) {
  if (!(x <= 0.0)) return std::log10(x);
  if (!throwOnError) return mGetMissingValueCode();
  if (x < 0.0) throw std::invalid_argument(kLogOfNegative);
  throw std::runtime_error(kFloatOverflow);
}

namespace {

// True when power * ln(base), base > 0, is beyond the double range (a power
// near DBL_MAX, such as 1/shape of a Weibull shape of 1e-306): forming it
// would trap in the armed state although the power is then 0 or beyond
// DBL_MAX, as the sign of the product says.
bool powerLogOverflows(double base, double power) {
  return std::fabs(power) > 1.0 && std::fabs(std::log(base)) > DBL_MAX / std::fabs(power);
}

}  // namespace

double mRaiseToPower(double base, double power, bool throwOnError) {
  if (base == 0.0) {
    if (power > 0.0) return 0.0;
    if (power == 0.0) return 1.0;
    throw std::invalid_argument("zero raised to a negative power");
  }
  if (base > 0.0) {
    if (powerLogOverflows(base, power)) {
      return (power > 0.0) == (base > 1.0) ? mHandleOverflow(throwOnError) : 0.0;
    }
    const double t = power * std::log(base);
    if (t < -MAX_EXPONENT) return 0.0;
    if (t > MAX_EXPONENT) return mHandleOverflow(throwOnError);
    return std::pow(base, power);
  }
  const double n = mNearestInteger(power);
  if (!mEqualWithinFuzz(power, n, 0.0)) {
    throw std::invalid_argument("negative number raised to a noninteger power");
  }
  if (powerLogOverflows(-base, power)) {
    if ((power > 0.0) != (-base > 1.0)) return 0.0;
    const double big = mHandleOverflow(throwOnError);
    return std::fmod(n, 2.0) != 0.0 ? -big : big;
  }
  const double t = power * std::log(-base);
  if (t < -MAX_EXPONENT) return 0.0;
  if (t <= MAX_EXPONENT) return std::pow(base, n);
  const double big = mHandleOverflow(throwOnError);
  // fmod, not a cast: an odd power beyond the 64-bit range cannot exist.
  return std::fmod(n, 2.0) != 0.0 ? -big : big;
}

double mSin(double x) {
  return std::sin(checkedTrigArgument(x));
}
double mCos(double x) {
  return std::cos(checkedTrigArgument(x));
}
double mTan(double x) {
  return std::tan(checkedTrigArgument(x));
}
double mATan(double x) {
  return std::atan(checkedTrigArgument(x));
}

double mASin(double x) {
  const double ax = std::fabs(x);
  if (ax > 1.0) return mGetMissingValueCode();
  if (1.0 - ax <= mGetEps(false)) return std::copysign(0.5 * mGetPi(), x);
  return std::asin(x);
}

double mACos(double x) {
  if (std::fabs(x) > 1.0) return mGetMissingValueCode();
  if (std::fabs(x) <= mGetEps(false)) return 0.5 * mGetPi();
  return std::acos(x);
}

double mDegreesToRadians(double degrees) {
  return mGetPi() * degrees / 180.0;
}
double mRadiansToDegrees(double radians) {
  return 180.0 * radians / mGetPi();
}

}  // namespace qel
