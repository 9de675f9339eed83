// Hypergeometric distribution (population N, M of them marked, sample n) and
// the P-value of Fisher's exact test.
//
// The support is lo = max(0, M + n - N) to hi = min(M, n). Tails come from the
// ELV hypergeometric routine; the mass is the closed form on the logarithms
// of binomial coefficients. The two-sided P-value adds to the tail on the
// observed side every outcome of the other side that is no more probable
// than the observed one (the "probability" ordering of Fisher's test).
#include <algorithm>
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/discrete_rules.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/saddle_density.h"
#include "utilities/distributions/tail_quantile.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/wrappers.h"

namespace qel {

namespace {

struct Support {
  int lo;
  int hi;
};

// M + n - N in 64 bits: M + n overflows an int near INT_MAX.
Support supportOf(int N, int M, int n) {
  const long long lo = static_cast<long long>(M) + n - N;
  return {lo > 0 ? static_cast<int>(lo) : 0, std::min(M, n)};
}

// Probability y is no more probable than the observed one: below it, or
// equal within the relative tolerance eps.
bool noMoreProbable(double candidate, double observed) {
  return candidate < observed || mApproxEqual(candidate, observed, mGetEps(false), 0.0);
}

// Direct tails below this are left to the ELV routine, which carries them
// as logarithms.
constexpr double kSmallestDirectTail = 1e-280;
// A term below 2^-56 of the sum no longer changes it.
constexpr double kRelativeStop = 1.4e-17;

// P(X <= k) / P(X = k) (downward) or P(X >= k) / P(X = k) (upward): the sum
// of products of neighbouring mass ratios, one pass, largest term first.
// Every term is positive, so the rounding error stays within a few units in
// the last place.
double massRatioSum(double k, double N, double M, double n, const Support& s, bool upward) {
  double sum = 1.0, term = 1.0;
  if (upward) {
    for (double i = k + 1.0; i <= s.hi; i += 1.0) {
      term *= (M - i + 1.0) * (n - i + 1.0) / (i * (N - M - n + i));
      sum += term;
      if (term <= kRelativeStop * sum) break;
    }
  } else {
    for (double i = k; i > s.lo; i -= 1.0) {
      term *= i * (N - M - n + i) / ((M - i + 1.0) * (n - i + 1.0));
      sum += term;
      if (term <= kRelativeStop * sum) break;
    }
  }
  return sum;
}

// P(X <= k) (lower) or P(X >= k), lo <= k <= hi, from the tail on the far
// side of the mode from k: computed directly there (Loader's mass times the
// ratio sum, as R's phyper does), as its complement otherwise. False at the
// historical ELV setting, for deep tails and a mass that fails.
bool fastHypergeometricTail(double k, int N, int M, int n, const Support& s, bool upper,
                            double* out) {
  if (elv::elvPrecision() != elv::ElvPrecision::Full) return false;
  const double dN = N, dM = M, dn = n;
  const double mode = std::floor((dM + 1.0) * (dn + 1.0) / (dN + 2.0));
  // The direct tail: P(X <= j) for j below the mode, P(X >= j) above.
  const bool directUpward = k > mode;
  double j = k;
  if (directUpward != upper) j = upper ? k - 1.0 : k + 1.0;
  if (j < s.lo || j > s.hi) return false;
  double mass;
  try {
    mass = saddle::hypergeometricMass(j, dN, dM, dn);
  } catch (const std::exception&) {
    return false;
  }
  const double direct = mass * massRatioSum(j, dN, dM, dn, s, directUpward);
  if (!(direct >= kSmallestDirectTail)) return false;
  *out = directUpward == upper ? std::min(direct, 1.0) : std::max(0.5 + (0.5 - direct), 0.0);
  return true;
}

}  // namespace

double mHypergeometricPdf(double x, int N, int M, int n) {
  double k;
  if (!discrete::massPoint(x, &k)) return 0.0;
  const Support s = supportOf(N, M, n);
  if (k < s.lo || k > s.hi) return 0.0;
  // A support of one point (n = 0, M = 0, M = N, n = N, an empty population)
  // carries all the mass.
  if (s.lo == s.hi) return 1.0;
  try {
    return saddle::hypergeometricMass(k, N, M, n);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  } catch (const std::invalid_argument&) {
    return mGetMissingValueCode();
  }
}

// The upper tail is P(X > k) + P(X = k).
double mHypergeometricCdf(double x, int N, int M, int n, bool upperTail) {
  const double k = upperTail ? discrete::upperPoint(x) : discrete::cdfPoint(x);
  const Support s = supportOf(N, M, n);
  if (k < s.lo) return upperTail ? 1.0 : 0.0;
  if (k > s.hi) return upperTail ? 0.0 : 1.0;
  if (s.lo == s.hi) return 1.0;  // k is the one point of the support
  double fast;
  if (fastHypergeometricTail(k, N, M, n, s, upperTail, &fast)) return fast;
  double lower = 0.0, above = 0.0, mass = 0.0;
  if (ElvFailed(elv_hypergeo_df(static_cast<unsigned long>(k), static_cast<unsigned long>(N),
                                static_cast<unsigned long>(M), static_cast<unsigned long>(n),
                                &lower, &above, &mass))) {
    return mGetMissingValueCode();
  }
  // The two parts of the upper tail add up to 1 plus rounding at the
  // lower end of the support.
  return upperTail ? std::min(above + mass, 1.0) : lower;
}

double mHypergeometricInvCdf(double p, int N, int M, int n) {
  if (N == M) return n;
  if (M == 0) return 0.0;
  if (N == n) return M;
  if (n == 0) return 0.0;
  const Support s = supportOf(N, M, n);
  if (p == 0.0) return s.lo;
  if (p >= 1.0) return s.hi;
  unsigned long k = 0;
  double fraction = 0.0;
  const bool lowerRoutine = p <= 0.5;
  const unsigned long uN = N, uM = M, un = n;
  const ElvStatus status = lowerRoutine
                               ? elv_hypergeo_lower_quant(p, uN, uM, un, &k, &fraction)
                               : elv_hypergeo_upper_quant(1.0 - p, uN, uM, un, &k, &fraction);
  if (ElvFailed(status)) {
    // Beyond the routines' range of tails: a search on the smaller tail.
    const TailPair tails = [N, M, n](double j, double* lower, double* above) {
      *lower = mHypergeometricCdf(j, N, M, n, false);
      *above = mHypergeometricCdf(j + 1.0, N, M, n, true);
      return !mIsNumericMissing(*lower) && !mIsNumericMissing(*above);
    };
    return mDiscreteTailQuantile(tails, p, s.lo, s.lo, s.hi);
  }
  return discrete::correctedQuantile(static_cast<double>(k), fraction, lowerRoutine);
}

double mHypergeometricPValue(int x, int N, int M, int n, EAlternative alternative) {
  if (alternative == kAlternativeLess) return mHypergeometricCdf(x, N, M, n, false);
  if (alternative == kAlternativeGreater) return mHypergeometricCdf(x, N, M, n, true);
  if (alternative != kAlternativeNotEqual) return mGetMissingValueCode();

  const Support s = supportOf(N, M, n);
  // An impossible outcome: only outcomes of probability 0 are as extreme, so
  // the walks below (up to 2^31 steps) would add nothing.
  if (x < s.lo || x > s.hi) return 0.0;
  // The mode: the classical start, moved by one towards a more probable
  // neighbour.
  int mode = static_cast<int>(std::floor((M + 1.0) * (n + 1.0) / (N + 2.0)));
  const double atMode = mHypergeometricPdf(mode, N, M, n);
  if (mode > s.lo && mHypergeometricPdf(mode - 1, N, M, n) > atMode) {
    --mode;
  } else if (mode < s.hi && mHypergeometricPdf(mode + 1, N, M, n) > atMode) {
    ++mode;
  }
  if (x == mode) return 1.0;

  const double observed = mHypergeometricPdf(x, N, M, n);
  double sum;
  if (x < mode) {
    sum = mHypergeometricCdf(x, N, M, n, false);
    if (mIsNumericMissing(sum)) return sum;
    for (int y = s.hi; y > x; --y) {
      const double py = mHypergeometricPdf(y, N, M, n);
      if (!noMoreProbable(py, observed)) break;
      sum += py;
    }
  } else {
    sum = mHypergeometricCdf(x, N, M, n, true);
    if (mIsNumericMissing(sum)) return sum;
    for (int y = s.lo; y < x; ++y) {
      const double py = mHypergeometricPdf(y, N, M, n);
      if (!noMoreProbable(py, observed)) break;
      sum += py;
    }
  }
  return sum;
}

}  // namespace qel
