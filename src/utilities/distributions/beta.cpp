// Beta and F distributions on the ELV beta family.
//
// The F quantile of a noncentral F has no routine of its own: it is a root
// search of the distribution function from 0 upward.
#include <cfloat>
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/beta_ratio.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/log_gamma.h"
#include "utilities/distributions/pvalue.h"
#include "utilities/distributions/saddle_density.h"
#include "utilities/distributions/tail_quantile.h"
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

// True when df1 x and df2 + df1 x stay far inside the double range (the
// comparisons are quiet, the division cannot overflow).
bool centralFArgumentsFit(double x, double df1, double df2) {
  return std::islessequal(df1, 1e300) && std::islessequal(df2, 1e300) &&
         std::islessequal(x, 1e300 / std::fmax(df1, 1.0));
}

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
    return saddle::betaDensity(x, a, b);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  } catch (const std::invalid_argument&) {
    return mGetMissingValueCode();
  }
}

double mBetaCdf(double x, double a, double b, bool upperTail) {
  if (x <= 0.0) return upperTail ? 1.0 : 0.0;
  if (x >= 1.0) return upperTail ? 0.0 : 1.0;
  double lower = 0.0, upper = 0.0, density = 0.0;
  if (betaratio::fastTails(a, b, x, 0.5 + (0.5 - x), &lower, &upper)) {
    return upperTail ? upper : lower;
  }
  if (ElvFailed(elv_beta_df(x, a, b, &lower, &upper, &density))) return mGetMissingValueCode();
  return upperTail ? upper : lower;
}

double mBetaInvCdf(double p, double a, double b) {
  if (!mPositiveShapes(a, b)) return mGetMissingValueCode();
  if (p == 0.0) return 0.0;
  if (p == 1.0) return 1.0;
  double q = 0.0;
  const ElvStatus status =
      p <= 0.5 ? elv_beta_lower_quant(p, a, b, &q) : elv_beta_upper_quant(1.0 - p, a, b, &q);
  // TOMS 708's tails where it answers: for small shapes the quantile
  // magnifies a tail's relative error by about 1/a (1/b near 1).
  const TailPair tails = [a, b](double x, double* lower, double* upper) {
    if (betaratio::fastTails(a, b, x, 0.5 + (0.5 - x), lower, upper)) return true;
    double density = 0.0;
    return !ElvFailed(elv_beta_df(x, a, b, lower, upper, &density));
  };
  if (!ElvFailed(status)) return mPolishedQuantile(tails, p, TailSupport::Unit, q);
  // Beyond the routines' range of tails: the smaller tail in logarithms.
  return mTailQuantile(tails, p, TailSupport::Unit, a / (a + b));
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
    return saddle::fDensity(x, df1, df2);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  } catch (const std::invalid_argument&) {
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
  // Central: I_z(df1/2, df2/2) at z = df1 x/(df1 x + df2), whose complement
  // df2/(df1 x + df2) is formed apart (TOMS 708).
  if (noncentrality == 0.0 && centralFArgumentsFit(x, df1, df2)) {
    const double scaled = df1 * x, sum = scaled + df2;
    if (std::isfinite(sum) &&
        betaratio::fastTails(df1 / 2.0, df2 / 2.0, scaled / sum, df2 / sum, lower, upper)) {
      return true;
    }
  }
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

double mFInvCdf(double p, double df1, double df2, double noncentrality) {
  if (!mPositiveShapes(df1, df2) || !std::isgreaterequal(noncentrality, 0.0)) {
    return mGetMissingValueCode();
  }
  if (noncentrality < kSmallestNoncentrality) noncentrality = 0.0;
  if (p == 0.0) return 0.0;
  if (p == 1.0) return mGetMissingValueCode();
  if (noncentrality == 0.0) {
    // P(F <= x) = I_w(df1/2, df2/2), w = df1 x/(df2 + df1 x), and
    // P(F > x) = I_y(df2/2, df1/2), y = 1 - w: the tails of the central law
    // for every x, however large or small.
    // The beta argument is taken below 1/2, where it carries no rounding
    // of a difference from 1.
    const TailPair tails = [df1, df2](double x, double* lower, double* upper) {
      const double w = df1 * x / (df2 + df1 * x);
      if (centralFArgumentsFit(x, df1, df2) &&
          betaratio::fastTails(df1 / 2.0, df2 / 2.0, w, df2 / (df2 + df1 * x), lower, upper)) {
        return true;
      }
      double density = 0.0;
      if (w <= 0.5) return !ElvFailed(elv_beta_df(w, df1 / 2.0, df2 / 2.0, lower, upper, &density));
      const double y = df2 / (df2 + df1 * x);
      return !ElvFailed(elv_beta_df(y, df2 / 2.0, df1 / 2.0, upper, lower, &density));
    };
    double q = 0.0;
    const ElvStatus status =
        p <= 0.5 ? elv_F_lower_quant(p, df1, df2, &q) : elv_F_upper_quant(1.0 - p, df1, df2, &q);
    if (!ElvFailed(status)) return mPolishedQuantile(tails, p, TailSupport::Positive, q);
    return mTailQuantile(tails, p, TailSupport::Positive, 1.0);
  }
  // The noncentral law: the smaller tail, solved in logarithms from about
  // the mean.
  const TailPair tails = [df1, df2, noncentrality](double x, double* lower, double* upper) {
    return mFCdf(x, df1, df2, noncentrality, lower, upper);
  };
  return mTailQuantile(tails, p, TailSupport::Positive, 1.0 + noncentrality / df1);
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
