// Binomial distribution and its two-sided likelihood-ratio P-value.
//
// The lower tail is the ELV binomial routine's; for n beyond the integer
// range, or when the routine fails, it is the complement of the incomplete
// beta ratio: P(X <= k) = 1 - I_p(k + 1, n - k) (ACM TOMS 708). The upper
// tail P(X >= x) is the lower tail of the mirrored variable n - X, whose
// success probability is 1 - p.
//
// The two-sided P-value orders the outcomes by their likelihood ratio
// against p (the G statistic): it adds the probability of every outcome at
// least as unlikely as the observed one on the far side of the mean.
#include <algorithm>
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/beta_ratio.h"
#include "utilities/distributions/discrete_rules.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/saddle_density.h"
#include "utilities/distributions/tail_quantile.h"
#include "utilities/elv/wrappers.h"
#include "utilities/higher_functions/incomplete_beta.h"

namespace qel {

namespace {

// 2^53: above it a double no longer holds every whole number.
constexpr double kExactCountLimit = 9007199254740992.0;

// P(X <= k), 0 <= k < n, by the incomplete beta ratio.
double binomialLowerTailByBeta(double k, double n, double p) {
  return mIncompleteBetaRatio(p, 1.0 - p, k + 1.0, n - k, true);
}

// P(X <= k) = 1 - I_p(k + 1, n - k) and P(X >= j) = I_p(j, n - j + 1) by
// TOMS 708, each tail in its own right from the given p (no mirrored 1 - p);
// the counts k and j are those of the mirrored route below. False where that
// route decides: outside 0 < p < 1, beyond 2^53 trials, deep tails.
bool binomialTailByBratio(double x, double n, double p, bool upperTail, double* out) {
  if (!(std::isgreater(p, 0.0) && std::isless(p, 1.0) && std::islessequal(n, kExactCountLimit))) {
    return false;
  }
  const double q = 0.5 + (0.5 - p);
  double lower = 0.0, upper = 0.0;
  if (!upperTail) {
    const double k = discrete::cdfPoint(x);
    if (k < 0.0 || k >= n) return false;
    if (!betaratio::fastTails(k + 1.0, n - k, p, q, &upper, &lower)) return false;
    *out = lower;
    return true;
  }
  const double j = n - discrete::cdfPoint(n - x);
  if (j <= 0.0 || j > n) return false;
  if (!betaratio::fastTails(j, n - j + 1.0, p, q, &upper, &lower)) return false;
  *out = upper;
  return true;
}

}  // namespace

double mBinomialPdf(double x, int n, double p) {
  double k;
  if (!discrete::massPoint(x, &k)) return 0.0;
  if (p == 0.0) return k == 0.0 ? 1.0 : 0.0;
  if (p == 1.0) return k == n ? 1.0 : 0.0;
  if (k < 0.0 || k > n) return 0.0;
  try {
    return saddle::binomialMass(k, n, p, 1.0 - p);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  } catch (const std::invalid_argument&) {
    return mGetMissingValueCode();
  }
}

double mBinomialCdf(double x, double n, double p, bool upperTail) {
  double fast;
  if (binomialTailByBratio(x, n, p, upperTail, &fast)) return fast;
  if (upperTail) {
    p = 1.0 - p;
    x = n - x;
  }
  const double k = discrete::cdfPoint(x);
  if (k < 0.0) return 0.0;
  if (k >= n) return 1.0;
  if (n <= mGetMaxInteger()) {
    double lower = 0.0, upper = 0.0, mass = 0.0;
    if (!ElvFailed(elv_binomial_df(static_cast<unsigned long>(k), static_cast<unsigned long>(n), p,
                                   &lower, &upper, &mass))) {
      return lower;
    }
  }
  // Beyond 2^53 trials (the negative binomial asks so for a huge x) with
  // n p^2 below rounding, the Poisson law of mean n p is the binomial to
  // double precision (Le Cam's bound n p^2 on the total variation).
  if (n > kExactCountLimit && n * p * p < 1e-16) return mPoissonCdf(k, n * p, false);
  const double tail = binomialLowerTailByBeta(k, n, p);
  return mIsNumericMissing(tail) ? tail : std::min(std::max(tail, 0.0), 1.0);
}

double mBinomialInvCdf(double p, int n, double prob) {
  if (p == 0.0) return 0.0;
  if (p == 1.0) return n;
  unsigned long k = 0;
  double fraction = 0.0;
  const bool lowerRoutine = p <= 0.5;
  const unsigned long trials = static_cast<unsigned long>(n);
  const ElvStatus status = lowerRoutine
                               ? elv_binomial_lower_quant(p, trials, prob, &k, &fraction)
                               : elv_binomial_upper_quant(1.0 - p, trials, prob, &k, &fraction);
  if (ElvFailed(status)) {
    // Beyond the routines' range of tails: a search on the smaller tail.
    const TailPair tails = [n, prob](double j, double* lower, double* above) {
      *lower = mBinomialCdf(j, n, prob, false);
      *above = mBinomialCdf(j + 1.0, n, prob, true);
      return !mIsNumericMissing(*lower) && !mIsNumericMissing(*above);
    };
    return mDiscreteTailQuantile(tails, p, 0.0, std::floor(n * prob), n);
  }
  return discrete::correctedQuantile(static_cast<double>(k), fraction, lowerRoutine);
}

double mLRatio(int n, int k, double p) {
  const double q = static_cast<double>(k) / n;
  double ratio = 0.0;
  if (k < n) ratio += (n - k) * mLog((1.0 - q) / (1.0 - p), true);
  if (k > 0) ratio += k * mLog(q / p, true);
  return ratio;
}

CmLRatio::CmLRatio(int n, double p) : n(n), p(p) {}

double CmLRatio::operator()(double x) {
  return mLRatio(n, static_cast<int>(x), p) - mTarget;
}

double mBinomialPValue(double x, int n, double p, EAlternative alternative) {
  if (alternative == kAlternativeLess) return mBinomialCdf(x, n, p, false);
  if (alternative == kAlternativeGreater) return mBinomialCdf(n - x, n, 1.0 - p, false);
  if (alternative != kAlternativeNotEqual) return 0.0;
  // An outcome outside 0..n is impossible: nothing is as extreme (and the
  // conversion to int below needs x in range).
  if (!(x >= 0.0 && x <= n)) return 0.0;

  int k = static_cast<int>(x);
  if (mEqualWithinFuzz(p, 0.5, 0.0)) {
    if (k == n / 2) return 1.0;
    // Symmetric: the far tail mirrors the near one exactly.
    return 2.0 * mBinomialCdf(k < n - k ? k : n - k, n, p, false);
  }
  if (mEqualWithinFuzz(static_cast<double>(k) / n, p, 0.0)) return 1.0;

  // Work below the mean.
  if (k > n * p) {
    p = 1.0 - p;
    k = n - k;
  }
  const double observed = mLRatio(n, k, p);
  double b = std::ceil(n * p);
  if (observed > mLRatio(n, n, p)) {
    b = n + 1.0;
  } else if (mLRatio(n, static_cast<int>(b), p) < observed) {
    // The smallest b above the mean whose ratio reaches the observed one.
    CmLRatio f(n, p);
    f.mIntegerValued = true;
    f.mTarget = observed;
    int status = 0;
    b = mRootFinder(b, n, f, &status);
    if (mIsNumericMissing(b)) return b;
  }
  if (b == k) return 1.0;
  const double nearTail = mBinomialCdf(k, n, p, false);
  const double farTail = mBinomialCdf(n - b, n, 1.0 - p, false);
  if (mIsNumericMissing(nearTail) || mIsNumericMissing(farTail)) return mGetMissingValueCode();
  // The two tails of a symmetric-in-likelihood set add to 1 plus rounding.
  return std::min(nearTail + farTail, 1.0);
}

}  // namespace qel
