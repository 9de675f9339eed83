// Counting: binomial coefficients, factorials, permutations and
// combinations, all through the logarithm of the gamma function.
#include <climits>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

double mLogNChooseK(int n, int k) {
  if (n == 0) return 0.0;
  // For k > n the last term meets a non-positive argument and throws.
  return mLogGamma(n + 1.0) - mLogGamma(k + 1.0) - mLogGamma(n - k + 1.0);
}

int mNChooseK(int n, int k) {
  try {
    const double value = mNearestInteger(mExponential(mLogNChooseK(n, k), true));
    // Beyond the int range there is no answer to give; 0 as on overflow.
    if (value > static_cast<double>(INT_MAX)) return 0;
    return static_cast<int>(value);
  } catch (const std::runtime_error&) {
    return 0;
  }
}

int mNFactorial(int n) {
  try {
    const double value = mExponential(mLogGamma(n + 1.0), true);
    if (value > mGetMaxInteger()) return 0;
    return static_cast<int>(mNearestInteger(value));
  } catch (const std::runtime_error&) {
    return 0;
  }
}

double mPermutations(double n, double k) {
  n = mNearestInteger(n);
  k = mNearestInteger(k);
  return mNearestInteger(mExponential(mLogGamma(n + 1.0) - mLogGamma(n - k + 1.0), true));
}

double mCombinations(double n, double k) {
  n = mNearestInteger(n);
  k = mNearestInteger(k);
  return mNearestInteger(
      mExponential(mLogGamma(n + 1.0) - mLogGamma(k + 1.0) - mLogGamma(n - k + 1.0), true));
}

int N_CHOOSE_K(const unsigned* n, const unsigned* k) {
  return mNChooseK(static_cast<int>(*n), static_cast<int>(*k));
}

}  // namespace qel
