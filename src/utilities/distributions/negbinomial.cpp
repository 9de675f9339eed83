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
#include "utilities/distributions/discrete_rules.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/saddle_density.h"
#include "utilities/special_functions/transcendental.h"

namespace qel {

namespace {

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
  } else {
    // p b(j; m, p): Loader's saddle-point binomial mass keeps the relative
    // accuracy that ln C(m, j) + j ln p + (m - j) ln(1 - p) loses to the
    // rounding of ln Gamma (1.3e-13 at k = 260, r = 2, p = 0.05).
    value = saddle::binomialMass(j, m, p, 1.0 - p);
  }
  return value * p;
}

// The smallest count k >= r with F(k) >= p, by doubling the distance from r
// and then bisecting on whole numbers. Both loops are bounded: the doubling
// ends at the double range, and the bisection stops when no whole number
// lies strictly between its ends (beyond 2^53 neighbouring doubles differ by
// more than 1, where a unit step would never move).
double smallestCountReaching(double p, double prob, double r, double start) {
  double lo = r, hi = start;
  for (;;) {
    const double f = mNegBinomialCdf(hi, prob, r, false);
    if (mIsNumericMissing(f)) return f;
    if (f >= p) break;
    lo = hi;
    if (hi >= DBL_MAX / 4.0) return mGetMissingValueCode();
    hi = r + 2.0 * (hi - r) + 1.0;
  }
  if (mNegBinomialCdf(lo, prob, r, false) >= p) return lo;
  for (;;) {
    const double mid = std::floor(lo + (hi - lo) / 2.0);
    if (!(mid > lo && mid < hi)) return hi;
    const double f = mNegBinomialCdf(mid, prob, r, false);
    if (mIsNumericMissing(f)) return f;
    (f >= p ? hi : lo) = mid;
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
    if (mEqualWithinFuzz(p, 1.0, 0.0) || mEqualWithinFuzz(prob, 0.0, 0.0)) {
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
