// Negative binomial distribution in the trials form: X counts the trials up
// to and including the r-th success, so the support starts at r. The
// geometric distribution is the case r = 1.
//
// The tails use the binomial relation P(X <= x) = P(B >= r), with B the
// number of successes in x trials; for r = 1 they are the closed forms of the
// geometric distribution. The quantile starts from the Cornish-Fisher
// expansion (skewness term) of the negative binomial and finishes with an
// integer search on the distribution function.
#include <algorithm>
#include <cfloat>
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/beta_ratio.h"
#include "utilities/distributions/discrete_rules.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/saddle_density.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

namespace {

// From here on counts take Loader's mass and the tails the exact-shape
// route below (k - r + 1 rounds beyond 2^53).
constexpr double kLargeCount = 1e5;
constexpr double kExactCountLimit = 9007199254740992.0;

bool isGeometric(double r) {
  return mEqualWithinFuzz(r, 1.0, 0.0);
}

// (1 - p)^m for a count m >= 0, through log1p where 1 - p would round away
// the digits of a small p.
double complementPower(double p, double m) {
  if (p > 0.0 && p < 0.5) return mExponential(m * std::log1p(-p), true);
  return mRaiseToPower(1.0 - p, m, true);
}

// 1 - (1 - p)^m, without cancellation for small p m.
double oneMinusComplementPower(double p, double m) {
  if (p > 0.0 && p < 0.5) return -std::expm1(m * std::log1p(-p));
  return 1.0 - mRaiseToPower(1.0 - p, m, true);
}

double negBinomialMass(double k, double p, double r) {
  if (k < r) return 0.0;
  if (isGeometric(r)) return p * complementPower(p, k - 1.0);
  const double jr = mNearestInteger(r - 1.0);
  if (!mEqualWithinFuzz(r - 1.0, jr, 0.0)) return 0.0;
  const double m = k - 1.0;
  const double j = jr;
  double value;
  if (p == 0.0) {
    value = j == 0.0 ? 1.0 : 0.0;
  } else if (p == 1.0) {
    value = m == j ? 1.0 : 0.0;
  } else if (j < 0.0 || j > m) {
    value = 0.0;
  } else if (m >= kLargeCount || j >= kLargeCount) {
    // C(k-1, r-1) p^r q^(k-r) = (r/k) C(k, r) p^r q^(k-r) by Loader's
    // saddle-point mass, whose digits do not depend on the size of k and r
    // (differences of ln Gamma lose them: 1e-9 at r = 1e6).
    return r / k * saddle::binomialMass(r, k, p, 0.5 + (0.5 - p));
  } else {
    // p b(j; m, p): Loader's saddle-point binomial mass keeps the relative
    // accuracy that ln C(m, j) + j ln p + (m - j) ln(1 - p) loses to the
    // rounding of ln Gamma (1.3e-13 at k = 260, r = 2, p = 0.05).
    value = saddle::binomialMass(j, m, p, 1.0 - p);
  }
  return value * p;
}

// Both tails at a count k > r with m = k - r as the shape (exact where
// k - r + 1 is not): P(X >= k) = 1 - I_p(r, m) = I_q(m, r), and P(X <= k) =
// I_p(r, m + 1) = I_p(r, m) + P(X = k) (DLMF 8.17.21). False when BRATIO
// fails.
bool largeCountTails(double k, double p, double r, double* lower, double* upper) {
  const double m = k - r;
  double w = 0.0, w1 = 0.0;
  if (!betaratio::anyTails(r, m, p, 0.5 + (0.5 - p), &w, &w1)) return false;
  *upper = w1;
  *lower = std::fmin(w + negBinomialMass(k, p, r), 1.0);
  return true;
}

// The smallest count k >= r with F(k) >= p, by doubling the distance from r
// and then bisecting on whole numbers. Both loops are bounded: the doubling
// ends at the double range, and the bisection stops when no whole number
// lies strictly between its ends (beyond 2^53 neighbouring doubles differ by
// more than 1, where a unit step would never move).
// Whether F(k) >= p, decided on the smaller tail: P(X > k) <= 1 - p for
// p > 1/2, where F(k) near 1 has lost the digits of 1 - F(k). Missing when
// a tail has no value.
double reaches(double k, double p, double prob, double r) {
  if (p <= 0.5) {
    const double f = mNegBinomialCdf(k, prob, r, false);
    return mIsNumericMissing(f) ? f : (f >= p ? 1.0 : 0.0);
  }
  // P(X > k) = P(X >= k + 1), or P(X >= k) - P(X = k) where k + 1 rounds.
  const double above = k + 1.0 < kExactCountLimit
                           ? mNegBinomialCdf(k + 1.0, prob, r, true)
                           : mNegBinomialCdf(k, prob, r, true) - mNegBinomialPdf(k, prob, r);
  return mIsNumericMissing(above) ? above : (above <= 0.5 + (0.5 - p) ? 1.0 : 0.0);
}

double smallestCountReaching(double p, double prob, double r, double start) {
  double lo = r, hi = start;
  for (;;) {
    const double f = reaches(hi, p, prob, r);
    if (mIsNumericMissing(f)) return f;
    if (f == 1.0) break;
    lo = hi;
    if (hi >= DBL_MAX / 4.0) return mGetMissingValueCode();
    hi = r + 2.0 * (hi - r) + 1.0;
  }
  const double atLo = reaches(lo, p, prob, r);
  if (mIsNumericMissing(atLo) || atLo == 1.0) return atLo == 1.0 ? lo : atLo;
  for (;;) {
    const double mid = std::floor(lo + (hi - lo) / 2.0);
    if (!(mid > lo && mid < hi)) return hi;
    const double f = reaches(mid, p, prob, r);
    if (mIsNumericMissing(f)) return f;
    (f == 1.0 ? hi : lo) = mid;
  }
}

}  // namespace

CmNegBinomialCdf::CmNegBinomialCdf(double p, double r, double target, bool tail)
    : mP(p), mR(r), mTail(tail) {
  mTarget = target;
}

double CmNegBinomialCdf::operator()(double x) {
  return mNegBinomialCdf(x, mP, mR, mTail) - mTarget;
}

double mNegBinomialPdf(double x, double p, double r) {
  double k;
  if (!discrete::massPoint(x, &k)) return 0.0;
  try {
    return negBinomialMass(k, p, r);
  } catch (const std::runtime_error&) {
    // ln G(k) beyond the double range (k near DBL_MAX): no answer.
    return mGetMissingValueCode();
  }
}

double mNegBinomialCdf(double x, double p, double r, bool upperTail) {
  const double k = upperTail ? discrete::upperPoint(x) : discrete::cdfPoint(x);
  if (!isGeometric(r) && (k - r >= kExactCountLimit || r >= kExactCountLimit) && k > r && p > 0.0 &&
      p < 1.0) {
    double lower = 0.0, upper = 0.0;
    // Where BRATIO refuses (a count near DBL_MAX), the binomial route below.
    if (largeCountTails(k, p, r, &lower, &upper)) return upperTail ? upper : lower;
  }
  if (!upperTail) {
    if (k < r) return 0.0;
    if (isGeometric(r)) return oneMinusComplementPower(p, k);
    // At least r successes in k trials.
    return mBinomialCdf(r, k, p, true);
  }
  if (k <= r) return 1.0;
  if (isGeometric(r)) return complementPower(p, k - 1.0);
  // Fewer than r successes in the first k - 1 trials.
  return mBinomialCdf(r - 1.0, k - 1.0, p, false);
}

double mNegBinomialInvCdf(double p, double prob, double r) {
  try {
    if (p <= mRaiseToPower(prob, r, true)) return r;
    if (mEqualWithinFuzz(p, 1.0, 0.0) || !(prob > 0.0)) {  // a tiny prob is a valid one
      return mGetMissingValueCode();
    }
    if (isGeometric(r)) {
      // The closed form ln(1 - p)/ln(1 - prob), checked by the bounded
      // search (a unit walk from it would never end past 2^53).
      const double k = std::ceil(std::log1p(-p) / std::log1p(-prob));
      return smallestCountReaching(p, prob, r, std::max(r, std::isfinite(k) ? k : r));
    }
    // Cornish-Fisher start: mean r/prob, standard deviation sqrt(r(1-prob))/prob,
    // skewness correction (z^2 - 1)(2 - prob)/6 on the scale of prob.
    const double z = mNormalInvCdf(p, 0.0, 1.0);
    if (mIsNumericMissing(z)) return z;
    double start = std::ceil(
        (r + z * mSqrt(r * (1.0 - prob), true) + (z * z - 1.0) * (2.0 - prob) / 6.0) / prob + 0.5);
    if (start < r) start = r;
    return smallestCountReaching(p, prob, r, start);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mGeometricPdf(double x, double p) {
  return mNegBinomialPdf(x, p, 1.0);
}

double mGeometricCdf(double x, double p, bool upperTail) {
  return mNegBinomialCdf(x, p, 1.0, upperTail);
}

double mGeometricInvCdf(double p, double prob) {
  return mNegBinomialInvCdf(p, prob, 1.0);
}

}  // namespace qel
