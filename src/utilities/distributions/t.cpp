// Student's t distribution, central and noncentral, on the ELV t routines.
//
// The noncentral density has no short closed form; it comes from the
// recurrence between distribution functions of the noncentral t,
//   f(x; df, d) = df/x (F(x sqrt((df + 2)/df); df + 2, d) - F(x; df, d)).
// The noncentral quantile solves the smaller tail in logarithms
// (tail_quantile.h), started from the mean of the noncentral t.
#include <algorithm>
#include <cfloat>
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/beta_ratio.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/large_parameters.h"
#include "utilities/distributions/log_gamma.h"
#include "utilities/distributions/noncentral_t.h"
#include "utilities/distributions/pvalue.h"
#include "utilities/distributions/saddle_density.h"
#include "utilities/distributions/small_shape_quantile.h"
#include "utilities/distributions/small_shape_tails.h"
#include "utilities/distributions/tail_quantile.h"
#include "utilities/elv/normal_precise.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/wrappers.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

namespace {

constexpr double kSearchLimit = 1e30;
// Largest admissible shape and width factor of the ELV routines' limit on
// the noncentrality.
constexpr double kElvMaxShape = 94906265.0;
constexpr double kElvWidthFactor = 6.1738;
constexpr int kElvDomainStatus = 3;

// The central t quantile by the ELV routine for the nearer tail.
constexpr double kNormalQuantileDf = 1e20;

double centralTQuantile(double p, double df) {
  if (!mPositiveShapes(df)) return mGetMissingValueCode();
  if (std::islessequal(df, smallshape::kTinyShape) && p > 0.0 && p < 1.0) {
    // A tiny df: |t| beyond the double range for all p but those within
    // about df of 1/2; the law is symmetric about 0.
    if (p == 0.5) return 0.0;
    const TailPair tails = [df](double x, double* lower, double* upper) {
      return mTCdf(x, df, 0.0, lower, upper);
    };
    return smallshape::quantile(tails, p, TailSupport::RealLine, p < 0.5 ? -1.0 : 1.0);
  }
  if (df > kNormalQuantileDf && p > 0.0 && p < 1.0) {
    // z + (z^3 + z) / (4 df) + O(df^-2) (Abramowitz & Stegun 26.7.5): the
    // second term is below 1e-17 z for |z| < 40 at these df.
    const double z = elv::normalQuantile(p);
    return z + (z * z * z + z) / (4.0 * df);
  }
  double q = 0.0;
  const ElvStatus status =
      p <= 0.5 ? elv_t_lower_quant(p, df, &q) : elv_t_upper_quant(1.0 - p, df, &q);
  if (!(p > 0.0 && p < 1.0)) return ElvFailed(status) ? mGetMissingValueCode() : q;
  const TailPair tails = [df](double x, double* lower, double* upper) {
    return mTCdf(x, df, 0.0, lower, upper);
  };
  if (!ElvFailed(status)) return mPolishedQuantile(tails, p, TailSupport::RealLine, q);
  // Beyond the routines' range of tails: the smaller tail in logarithms.
  return mTailQuantile(tails, p, TailSupport::RealLine, p < 0.5 ? -1.0 : 1.0);
}

// Beyond |t| = 1e100 the routine answers exact 0 and 1 from |t| = 6.7e143
// on; the tail is there K n^((n+1)/2) |t|^-n / n with K the density's
// constant (saddle_density.h), the next term being smaller by n(n+1)/(2 t^2).
constexpr double kFarT = 1e100;
constexpr double kElvMaxDf = 189812530.0;

double centralTFarTail(double t, double n) {
  const double u = (n + 1.0) / 2.0, v = n / 2.0;
  const double logK = saddle::stirlerr(u) - saddle::stirlerr(v) - saddle::bd0(v, u) -
                      0.918938533204672741780329736406;
  const double logTail = logK + u * std::log(n) - n * std::log(t) - std::log(n);
  return logTail < -708.39 ? 0.0 : std::exp(logTail);
}

// Central tails by the incomplete beta ratio, as TOMS 708 gives it: for
// t < 0, P(T <= t) = I_x(n/2, 1/2) / 2 with x = n/(n + t^2), 1 - x =
// t^2/(n + t^2) each formed with one rounding; the other tail is
// 1/2 + (1 - I_x)/2, free of cancellation. False where TOMS 708 does not
// answer (historical ELV setting, deep tails, t^2 outside the double range).
bool centralTByIncompleteBeta(double t, double n, double* lower, double* upper) {
  if (!std::isless(std::fabs(t), kFarT) || !std::isgreater(n, 0.0) || std::isinf(n)) return false;
  if (t == 0.0) {
    *lower = *upper = 0.5;
    return true;
  }
  const double t2 = t * t;
  const double s = n + t2;
  double ratio = 0.0, complement = 0.0;
  // Beyond the ELV routine's df, BRATIO's deep tails too (no other route).
  if (!betaratio::fastTails(n / 2.0, 0.5, n / s, t2 / s, &ratio, &complement) &&
      !(n > kElvMaxDf && betaratio::anyTails(n / 2.0, 0.5, n / s, t2 / s, &ratio, &complement))) {
    return false;
  }
  *(t < 0.0 ? lower : upper) = 0.5 * ratio;
  *(t < 0.0 ? upper : lower) = 0.5 + 0.5 * complement;
  return true;
}

// Central tails at df n <= 2e-5 by the beta law (n/2, 1/2) at
// z = n/(n + t^2), 1 - z = t^2/(n + t^2), both in logarithms (t^2 may
// overflow, z fall below the normal range): almost all the mass lies beyond
// any fixed |t|, half on each side, so both tails near 1/2 carry the tiny
// tail I_z(n/2, 1/2)/2 of the series.
bool tinyDfTails(double t, double n, double* lower, double* upper) {
  if (!std::islessequal(n, 2.0 * smallshape::kTinyShape) || !(n >= DBL_MIN) || !std::isfinite(t) ||
      t == 0.0) {
    return false;
  }
  if (n < 2.0 * DBL_MIN) {
    // n/2 below the normal range: the tail beyond |t| is 1/2 within
    // n |ln z| < 1e-304 of it, on either side.
    *lower = *upper = 0.5;
    return true;
  }
  const double at = std::fabs(t);
  double lz, lw;
  if (at >= 1.0) {
    lw = -std::log1p(n / at / at);
    lz = std::log(n) - 2.0 * std::log(at) + lw;
  } else {
    lz = -std::log1p(at * at / n);
    lw = 2.0 * std::log(at) - std::log(n) + lz;
  }
  const auto expOrZero = [](double v) { return v < -708.39 ? 0.0 : std::exp(v); };
  double ratio = 0.0, complement = 0.0;
  if (!smallshape::betaTails(n / 2.0, 0.5, expOrZero(lz), lz, expOrZero(lw), lw, &ratio,
                             &complement)) {
    return false;
  }
  *(t < 0.0 ? lower : upper) = 0.5 * ratio;
  *(t < 0.0 ? upper : lower) = 0.5 + 0.5 * complement;
  return true;
}

// The starting bracket of the noncentral quantile search.
constexpr double kNormalLimitDf = 1e10;

void startingBracket(double p, double df, double noncentrality, double* x1, double* x2) {
  if (df > kNormalLimitDf) {
    // The normal limit N(delta, 1): the ln Gamma difference below would
    // cancel to nothing (and the variance to a negative number).
    const double a = p >= 0.5 ? p : p / 1.1, b = p >= 0.5 ? 1.0 - (1.0 - p) / 1.1 : p;
    *x1 = noncentrality + mNormalInvCdf(a, 0.0, 1.0);
    *x2 = noncentrality + mNormalInvCdf(b, 0.0, 1.0);
    return;
  }
  double mean = noncentrality;
  if (df > 1.0) {
    mean = noncentrality * std::sqrt(df / 2.0) *
           mExponential(mLogGamma((df - 1.0) / 2.0) - mLogGamma(df / 2.0), true);
  }
  if (df > 2.0) {
    const double variance = (1.0 + noncentrality * noncentrality) * df / (df - 2.0) - mean * mean;
    const double s = mSqrt(variance, true);
    const double a = p >= 0.5 ? p : p / 1.1;
    const double b = p >= 0.5 ? 1.0 - (1.0 - p) / 1.1 : p;
    *x1 = mean + s * mNormalInvCdf(a, 0.0, 1.0);
    *x2 = mean + s * mNormalInvCdf(b, 0.0, 1.0);
  } else {
    // No variance: a bracket of width p next to the mean, widened by the
    // bracket finder.
    *x1 = mean + p;
    *x2 = mean + 2.0 * p;
  }
  if (*x1 > *x2) std::swap(*x1, *x2);
}

}  // namespace

CmTCdf::CmTCdf(double df, double noncentrality, double p)
    : mDf(df), mNoncentrality(noncentrality), mP(p) {
  mTarget = p;
  mAbsoluteToleranceForX = kQuantileSearchToleranceX;
}

double CmTCdf::operator()(double x) {
  const double lower = mTCdf(x, mDf, mNoncentrality, false);
  if (mIsNumericMissing(lower)) return lower;
  return lower - mP;
}

double mTPdf(double x, double df, double noncentrality) {
  if (noncentrality == 0.0) {
    // Below df = 1e-290 the density is df / (2 sqrt(df + x^2)) to double
    // precision (the corrections are O(df ln df)); the general form would
    // halve a df near DBL_MIN into the subnormal range, which the armed state
    // reads as zero (df 3e-308 at x = 1 gave 4.9e-155 for 1.5e-308).
    if (df < 1e-290) return df / (2.0 * std::hypot(std::sqrt(df), x));
    try {
      return saddle::tDensity(x, df);
    } catch (const std::exception&) {
      return mGetMissingValueCode();
    }
  }
  try {
    if (x == 0.0) {
      const double a = (df + 1.0) / 2.0;
      const double b = df / 2.0;
      return mExponential(mLogGammaOfPositive(a) - mLogGammaOfPositive(b) -
                              0.5 * mLog(mGetPi() * df, true) - a * std::log1p(x * x / df) -
                              noncentrality * noncentrality / 2.0,
                          true);
    }
    if (df < nct::kTinyDfLimit && elv::elvPrecision() == elv::ElvPrecision::Full) {
      return nct::tinyDfDensity(x, df, noncentrality);
    }
    const double f1 = mTCdf(x * std::sqrt((df + 2.0) / df), df + 2.0, noncentrality, false);
    const double f2 = mTCdf(x, df, noncentrality, false);
    if (mIsNumericMissing(f1) || mIsNumericMissing(f2)) return mGetMissingValueCode();
    return (f1 - f2) * df / x;
  } catch (const std::runtime_error&) {
    return 0.0;
  } catch (const std::invalid_argument&) {
    return mGetMissingValueCode();
  }
}

bool mTCdf(double x, double df, double noncentrality, double* lower, double* upper) {
  const double missing = mGetMissingValueCode();
  if (mIsNumericMissing(x)) {
    *lower = *upper = missing;
    return false;
  }
  ElvStatus status;
  try {
    if (noncentrality == 0.0 && tinyDfTails(x, df, lower, upper)) return true;
    if (noncentrality == 0.0 && centralTByIncompleteBeta(x, df, lower, upper)) return true;
    if (noncentrality == 0.0 && std::fabs(x) > kFarT && df > 0.0 && df <= kElvMaxDf &&
        elv::elvPrecision() == elv::ElvPrecision::Full) {
      const double tail = centralTFarTail(std::fabs(x), df);
      *(x < 0.0 ? lower : upper) = tail;
      *(x < 0.0 ? upper : lower) = 1.0 - tail;
      return true;
    }
    if (noncentrality != 0.0 && elv::elvPrecision() == elv::ElvPrecision::Full &&
        nct::tails(x, df, noncentrality, lower, upper)) {
      return true;
    }
    if (noncentrality != 0.0 && large::noncentralTTails(x, df, noncentrality, lower, upper)) {
      return true;
    }
    status = elv_t_ncdf(x, df, noncentrality, lower, upper);
  } catch (const std::runtime_error&) {
    // A df so small (1e-300) that the routine's arithmetic divides by zero
    // or overflows: no answer.
    *lower = *upper = missing;
    return false;
  } catch (const std::invalid_argument&) {
    *lower = *upper = missing;
    return false;
  }
  if (!ElvFailed(status)) return true;
  if (status == kElvDomainStatus && noncentrality != 0.0) {
    // The noncentrality is beyond the routine's limit. Retry just inside a
    // noncentrality from the limit's quadratic: a result already extreme in
    // the direction of the noncentrality stays so for the larger one.
    const double r = mRootOfQuadratic(1.0, kElvWidthFactor, df / 2.0 - kElvMaxShape);
    if (!mIsNumericMissing(r) && r >= 0.0) {
      const double delta = std::copysign(std::sqrt(r + r) * (1.0 - mGetEps(false)), noncentrality);
      if (!ElvFailed(elv_t_ncdf(x, df, delta, lower, upper))) {
        if ((noncentrality > 0.0 && *lower == 0.0) || (noncentrality < 0.0 && *upper == 1.0)) {
          return true;
        }
      }
    }
  }
  *lower = *upper = missing;
  return false;
}

double mTCdf(double x, double df, double noncentrality, bool upperTail) {
  double lower = 0.0, upper = 0.0;
  mTCdf(x, df, noncentrality, &lower, &upper);
  const double tail = upperTail ? upper : lower;
  // The mixture sums of the noncentral routine cancel to an absolute error
  // of about the noncentrality's size (-4e-17 at 1e-16 far out), which can
  // carry a tail just outside [0, 1]; the true tail is inside.
  return mIsNumericMissing(tail) ? tail : std::min(std::max(tail, 0.0), 1.0);
}

double mTInvCdf(double p, double df, double noncentrality) {
  if (!mPositiveShapes(df) || std::isnan(noncentrality)) return mGetMissingValueCode();
  if (p == 0.0 || p == 1.0) return mGetMissingValueCode();
  if (noncentrality == 0.0) return centralTQuantile(p, df);
  try {
    // The smaller tail, solved in logarithms from the normal approximation.
    double x1 = 0.0, x2 = 0.0;
    startingBracket(0.5, df, noncentrality, &x1, &x2);
    const TailPair tails = [df, noncentrality](double x, double* lower, double* upper) {
      return mTCdf(x, df, noncentrality, lower, upper);
    };
    return mTailQuantile(tails, p, TailSupport::RealLine, x1);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  } catch (const std::invalid_argument&) {
    return mGetMissingValueCode();
  }
}

double mTPValue(double t, double df, EAlternative alternative) {
  if (mIsNumericMissing(t)) return t;
  double lower = 0.0, upper = 0.0;
  if (!mTCdf(t, df, 0.0, &lower, &upper)) return mGetMissingValueCode();
  return mPValueFromTails(lower, upper, alternative);
}

namespace {

// The critical value for a per-comparison level a.
double tCritValueAt(double a, double df, EAlternative alternative) {
  double p = 0.0;
  if (alternative == kAlternativeLess || alternative == kAlternativeGreater) {
    p = 1.0 - a;
  } else if (alternative == kAlternativeNotEqual) {
    p = 1.0 - a / 2.0;
  }
  return mTInvCdf(p, df, 0.0);
}

}  // namespace

// Bonferroni: the level divided among k comparisons.
double mTCritValue(double alpha, double df, EAlternative alternative, int k) {
  return tCritValueAt(alpha / k, df, alternative);
}

// Sidak: 1 - (1 - alpha)^(1/k) per comparison.
double mTSidakCritValue(double alpha, double df, EAlternative alternative, int k) {
  return tCritValueAt(1.0 - mRaiseToPower(1.0 - alpha, 1.0 / k, true), df, alternative);
}

}  // namespace qel
