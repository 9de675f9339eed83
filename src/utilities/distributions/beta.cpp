// Beta and F distributions on the ELV beta family.
//
// The F quantile of a noncentral F has no routine of its own: it is a root
// search of the distribution function from 0 upward.
#include <cfloat>
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/log_gamma.h"
#include "utilities/distributions/pvalue.h"
#include "utilities/elv/wrappers.h"
#include "utilities/special_functions/transcendental.h"

namespace qel {

namespace {

// A noncentrality below this counts as 0.
constexpr double kSmallestNoncentrality = 2.2250738585072014e-307;
// The search for a noncentral quantile runs up to 1e30, or up to the largest
// argument that the F routine admits (189812530), whichever is smaller:
// beyond that the routine has no value, and the search would have none at
// its upper end.
constexpr double kSearchLimit = 1e30;
constexpr double kLargestFArgument = 189812530.0;

}  // namespace

// --- Beta ------------------------------------------------------------------

double mBetaPdf(double x, double a, double b) {
  if (x < 0.0 || x > 1.0) return 0.0;
  if (x == 0.0) {
    if (a < 1.0) return mGetMissingValueCode();
    return a == 1.0 ? b : 0.0;
  }
  if (x == 1.0) {
    if (b < 1.0) return mGetMissingValueCode();
    return b == 1.0 ? a : 0.0;
  }
  try {
    return mExponential((a - 1.0) * mLog(x, true) + (b - 1.0) * std::log1p(-x) + mLogGammaOfPositive(a + b) -
                            mLogGammaOfPositive(a) - mLogGammaOfPositive(b),
                        true);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mBetaCdf(double x, double a, double b, bool upperTail) {
  if (x <= 0.0) return upperTail ? 1.0 : 0.0;
  if (x >= 1.0) return upperTail ? 0.0 : 1.0;
  double lower = 0.0, upper = 0.0, density = 0.0;
  if (ElvFailed(elv_beta_df(x, a, b, &lower, &upper, &density))) return mGetMissingValueCode();
  return upperTail ? upper : lower;
}

double mBetaInvCdf(double p, double a, double b) {
  if (p == 0.0) return 0.0;
  if (p == 1.0) return 1.0;
  double q = 0.0;
  const ElvStatus status =
      p <= 0.5 ? elv_beta_lower_quant(p, a, b, &q) : elv_beta_upper_quant(1.0 - p, a, b, &q);
  return ElvFailed(status) ? mGetMissingValueCode() : q;
}

// --- F ---------------------------------------------------------------------

CmFCdf::CmFCdf(double df1, double df2, double noncentrality, double p)
    : mDf1(df1), mDf2(df2), mNoncentrality(noncentrality), mP(p) {
  mTarget = p;
  mAbsoluteToleranceForX = kQuantileSearchToleranceX;
}

double CmFCdf::operator()(double x) {
  const double lower = mFCdf(x, mDf1, mDf2, mNoncentrality, false);
  if (mIsNumericMissing(lower)) return lower;
  return lower - mP;
}

double mFPdf(double x, double df1, double df2) {
  if (x <= 0.0) return 0.0;
  try {
    const double a = df1 / 2.0;
    const double b = df2 / 2.0;
    const double c = a + b;
    const double ratio = df1 / df2;
    return mExponential(mLogGammaOfPositive(c) - mLogGammaOfPositive(a) - mLogGammaOfPositive(b) + a * mLog(ratio, true) +
                            (a - 1.0) * mLog(x, true) - c * std::log1p(x * ratio),
                        true);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

bool mFCdf(double x, double df1, double df2, double noncentrality, double* lower, double* upper) {
  if (mIsNumericMissing(x)) {
    *lower = *upper = x;
    return false;
  }
  if (x <= 0.0) {
    *lower = 0.0;
    *upper = 1.0;
    return true;
  }
  if (noncentrality < kSmallestNoncentrality) noncentrality = 0.0;
  if (ElvFailed(elv_F_ncdf(x, df1, df2, noncentrality, lower, upper))) {
    *lower = *upper = mGetMissingValueCode();
    return false;
  }
  return true;
}

double mFCdf(double x, double df1, double df2, double noncentrality, bool upperTail) {
  double lower = 0.0, upper = 0.0;
  mFCdf(x, df1, df2, noncentrality, &lower, &upper);
  return upperTail ? upper : lower;
}

// Doublings or halvings of the quantile bracket: enough to cross the double
// range from any start.
constexpr int kBracketSteps = 2100;

double mFInvCdf(double p, double df1, double df2, double noncentrality) {
  if (noncentrality < kSmallestNoncentrality) noncentrality = 0.0;
  if (p == 0.0) return 0.0;
  if (p == 1.0) return mGetMissingValueCode();
  if (noncentrality == 0.0) {
    double q = 0.0;
    const ElvStatus status =
        p <= 0.5 ? elv_F_lower_quant(p, df1, df2, &q) : elv_F_upper_quant(1.0 - p, df1, df2, &q);
    return ElvFailed(status) ? mGetMissingValueCode() : q;
  }
  try {
    CmFCdf f(df1, df2, noncentrality, p);
    // Bracket by doubling or halving from (df1 + noncentrality)/df1, the
    // centre of the law for large df2, so that the search never evaluates
    // the far tails, where the mixture sums of a large noncentrality take
    // a second a call (1e8: 13 s from the bracket [0, 1e30]).
    const double limit = std::fmin(kSearchLimit, kLargestFArgument);
    double lo = std::fmin((df1 + noncentrality) / df1, limit), hi = lo;
    double value = f(lo);
    if (mIsNumericMissing(value)) return value;
    const bool startBelow = value < 0.0;
    for (int i = 0; startBelow && value < 0.0 && i < kBracketSteps && hi < limit; ++i) {
      lo = hi;
      hi = std::fmin(2.0 * hi, limit);
      value = f(hi);
      if (mIsNumericMissing(value)) return value;
    }
    for (int i = 0; !startBelow && value >= 0.0 && i < kBracketSteps && lo > 0.0; ++i) {
      hi = lo;
      lo = lo > DBL_MIN ? lo / 2.0 : 0.0;
      value = f(lo);
      if (mIsNumericMissing(value)) return value;
    }
    int status = 0;
    return mRootFinder(lo, hi, f, &status);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mFPValue(double x, double df1, double df2, EAlternative alternative) {
  double lower = 0.0, upper = 0.0;
  if (!mFCdf(x, df1, df2, 0.0, &lower, &upper)) return mGetMissingValueCode();
  return mPValueFromTails(lower, upper, alternative);
}

// Only the one-sided critical values exist: the two-sided case is 0.0.
double mFCritValue(double alpha, double df1, double df2, EAlternative alternative) {
  if (alternative == kAlternativeLess) return mFInvCdf(alpha, df1, df2, 0.0);
  if (alternative == kAlternativeGreater) return mFInvCdf(1.0 - alpha, df1, df2, 0.0);
  return 0.0;
}

}  // namespace qel
