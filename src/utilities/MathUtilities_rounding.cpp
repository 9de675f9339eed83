// Rounding to decimal places, to significant digits and to multiples.
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/CheckedFunctions.h"

namespace qel {

namespace {

constexpr int kLargestChunk = 308;

double roundHalfAwayFromZero(double y) {
  return y >= 0.0 ? std::floor(y + 0.5) : std::ceil(y - 0.5);
}

}  // namespace

double mScaleByPowerOfTen(double x, int p) {
  // 10^308 is the largest power of ten below the double range.
  while (p > kLargestChunk) {
    x *= 1e308;
    p -= kLargestChunk;
  }
  while (p < -kLargestChunk) {
    x /= 1e308;
    p += kLargestChunk;
  }
  if (p > 0) return x * std::pow(10.0, p);
  if (p < 0) return x / std::pow(10.0, -p);
  return x;
}

double mRound(double x, int places) {
  if (mIsNumericMissing(x) || x == 0.0) return x;
  const double magnitude = std::log10(std::fabs(x)) + places;
  if (magnitude > 308.0 || magnitude < -307.0) return mGetMissingValueCode();
  return mScaleByPowerOfTen(roundHalfAwayFromZero(mScaleByPowerOfTen(x, places)), -places);
}

double mRoundToSigDigits(double x, int digits) {
  const int places =
      x == 0.0 ? 0 : digits - static_cast<int>(std::floor(std::log10(std::fabs(x)))) - 1;
  return mRound(x, places);
}

double mRoundToMultiple(double x, double m) {
  try {
    // The quotient is taken through logarithms; x = 0 or m = 0 meets the
    // "float overflow" of the checked logarithm and leaves x as it is.
    const double q = mExponential(mLog(std::fabs(x), true) - mLog(std::fabs(m), true), true);
    return mTransferSign(mNearestInteger(q) * m, x);
  } catch (const std::runtime_error&) {
    return x;
  }
}

}  // namespace qel
