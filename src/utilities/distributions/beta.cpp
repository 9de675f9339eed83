// Beta and F distributions on the ELV beta family.
//
// The F quantile of a noncentral F has no routine of its own: it is a root
// search of the distribution function from 0 upward.
#include <qel/elv.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/beta_ratio.h"
#include "utilities/distributions/gamma_ratio.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/large_parameters.h"
#include "utilities/distributions/log_gamma.h"
#include "utilities/distributions/pvalue.h"
#include "utilities/distributions/saddle_density.h"
#include "utilities/distributions/series_quantile.h"
#include "utilities/distributions/small_shape_quantile.h"
#include "utilities/distributions/small_shape_tails.h"
#include "utilities/distributions/tail_quantile.h"
#include "utilities/elv/normal_precise.h"
#include "utilities/elv/wrappers.h"
#include "utilities/higher_functions/transcendental.h"

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

// The ELV beta routines answer a lower tail of 0 at an argument below
// 2.2e-288, which is wrong for a small shape: I_z(s, t) is
// z^s (1-z)^t / (s B(s, t)) (1 + O(t z)), near 1 for s = 5e-301.
// tinyBetaLogLower gives ln I_z(s, t) by that leading term for ln z = lz,
// or false where t z is not negligible or the shapes leave the range of the
// log-density routine.
bool tinyBetaLogLower(double lz, double s, double t, double* out) {
  constexpr double kTiny = 2.2250738585072014e-288;
  if (!(s >= DBL_MIN && t >= DBL_MIN) || t * std::exp(lz) > 1e-17) return false;
  try {
    if (s <= 1e-5) {
      // ln(1 / (s B(s, t))) = ln Gamma(s + t) - ln Gamma(t) - ln Gamma(1 + s)
      // by its Taylor series in s (Abramowitz & Stegun 6.1.33, 6.4.1), so
      // that ln I stays accurate to its last digit where I is within 1e-298
      // of 1 and the other tail is -expm1(ln I).
      constexpr double kEuler = 0.57721566490153286061, kZeta2 = 1.6449340668482264365,
                       kZeta3 = 1.2020569031595942854;
      double ans[2] = {0.0, 0.0};
      int nz = 0, ierr = 0;
      XDPSIFN(t, 1, 1, 2, ans, &nz, &ierr);
      if (ierr == 0) {
        const double series = s * (psi(t) + kEuler) + s * s * (ans[0] - kZeta2) / 2.0 +
                              s * s * s * (-2.0 * ans[1] + 2.0 * kZeta3) / 6.0;
        // (1-z)^t times the first term of 2F1(s + t, 1; s + 1; z), the
        // factor that completes the leading term, is 1 + s (1 - t) z/(1 + s)
        // to first order in z: next to s ln z, t z alone would not cancel.
        *out = s * lz + series + s * (1.0 - t) * std::exp(lz) / (1.0 + s);
        return std::isfinite(*out);
      }
    }
    // ln B(s, t) from the density at the normal point kTiny (z itself may
    // be denormal, which the armed state reads as 0).
    double lp = 0.0;
    lnpbeta(&lp, s, t, kTiny);
    const double lnBeta = (s - 1.0) * std::log(kTiny) + (t - 1.0) * std::log1p(-kTiny) - lp;
    *out = s * lz + t * std::log1p(-std::exp(lz)) - std::log(s) - lnBeta;
    return std::isfinite(*out);
  } catch (const std::runtime_error&) {
    return false;
  }
}

// The F tails where a beta argument, y = c x/(d + c x) or w = 1 - y with
// c = df1/2, d = df2/2, lies below 1e-280 (clear of the routines' border).
// Small y: every further component of the Poisson mixture (mean
// L = noncentrality/2) carries another factor y, so the lower tail is
// e^-L I_y(c, d) and the upper tail -expm1 of its logarithm. Small w: the
// upper tail is I_w(d, c) for a central F; a noncentral one mixes
// I_w(d, c + j) over all j, answered here only where even the largest
// component that counts underflows (otherwise no answer: *lower = NaN).
// Tails below a bound under e^-760 are 0 without further work.
// False where neither argument is that small, for the routines to answer.
// The noncentral mixture at w = df2/(df1 x + df2) < 1e-280 (ln w = lw):
// P(F > x) = sum_j W(j) I_w(d, c + j), W(j) = e^-L L^j/j!, each I_w by its
// leading term in logarithms, and P(F <= x) = sum_j W(j) (1 - I_w(d, c + j)),
// positive terms of the order of d where d is tiny. NaN where a term is out
// of reach.
bool tinyWMixture(double lw, double c, double d, double L, double* lower, double* upper) {
  const double spread = 40.0 * std::sqrt(L) + 40.0;
  double lo = 0.0, up = 0.0;
  for (double j = std::max(0.0, std::floor(L - spread)); j <= L + spread; j += 1.0) {
    const double weight = saddle::poissonMass(j, L);
    double lnTail = 0.0;
    if (!tinyBetaLogLower(lw, d, c + j, &lnTail)) {
      *lower = *upper = mQuietNaN();
      return true;
    }
    up += weight * (lnTail < -708.39 ? 0.0 : std::exp(lnTail));
    lo += weight * -std::expm1(lnTail);
  }
  *lower = std::min(lo, 1.0);
  *upper = std::min(up, 1.0);
  return true;
}

bool tinyBetaArgument(double x, double df1, double df2, double noncentrality, double* lower,
                      double* upper) {
  const double c = 0.5 * df1, d = 0.5 * df2, L = 0.5 * noncentrality;
  if (!(c >= DBL_MIN && d >= DBL_MIN)) return false;  // no libm call on a denormal
  const double lr = std::log(c) + std::log(x) - std::log(d), border = std::log(1e-280);
  // ln of a bound on I_z(s, t): (z (s + t))^s / Gamma(s + 1), and on every
  // I_z(s, t + j) that counts with t + j for t.
  const double lnSum = std::log(std::max(c, d)) + 0.6931471805599453;
  const auto lnBound = [lnSum](double lz, double s, double t) {
    return s * (lz + std::max(lnSum, std::log(t))) - std::lgamma(s + 1.0);
  };
  double lnTail = 0.0;
  if (lr < border) {
    const double ly = lr - std::log1p(std::exp(lr));
    if (lnBound(ly, c, d) < -760.0) {
      lnTail = -HUGE_VAL;
    } else if (!tinyBetaLogLower(ly, c, d, &lnTail)) {
      return false;
    }
    lnTail -= L;
    *lower = lnTail < -708.39 ? 0.0 : std::exp(lnTail);
    *upper = -std::expm1(lnTail);
    return true;
  }
  if (lr <= -border) return false;
  const double lw = -lr - std::log1p(std::exp(-lr));
  // j up to L + 40 sqrt(L) + 40 carries all the mixture's weight.
  const double top = L + 40.0 * std::sqrt(L) + 40.0 + c;
  if (lnBound(lw, d, L > 0.0 ? top : c) < -760.0) {
    lnTail = -HUGE_VAL;
  } else if (L > 0.0) {
    return tinyWMixture(lw, c, d, L, lower, upper);
  } else if (!tinyBetaLogLower(lw, d, c, &lnTail)) {
    return false;
  }
  *upper = lnTail < -708.39 ? 0.0 : std::exp(lnTail);
  *lower = -std::expm1(lnTail);
  return true;
}

// Both tails of F beyond the F routine's largest argument, straight from the
// beta laws, with c = df1/2, d = df2/2 and the beta argument below 1/2:
// P(F <= x) is the lower tail at y = c x/(d + c x) of the beta law (c, d)
// where c x <= d, and P(F > x) the lower tail at w = d/(d + c x) of the
// law (d, c) otherwise; a noncentral F mixes over the shape c + j
// (beta_ncdf, beta_ncdf2 with L/2). Here w >= 1e-280 (tinyBetaArgument
// takes the rest); beyond c x = 1e13 d it is formed from logarithms, as
// c x may overflow.
ElvStatus betaMixtureTails(double x, double df1, double df2, double noncentrality, double* lower,
                           double* upper) {
  const double c = 0.5 * df1, d = 0.5 * df2, L = 0.5 * noncentrality;
  double density = 0.0;
  const double lr = std::log(c) + std::log(x) - std::log(d);
  if (lr <= 0.0) {
    const double y = c * x / (d + c * x);
    if (L == 0.0) return elv_beta_df(y, c, d, lower, upper, &density);
    return elv_beta_ncdf(y, c, d, L, lower, upper);
  }
  const double w =
      lr < 30.0 && d < 1e290 ? d / (d + c * x) : std::exp(-lr - std::log1p(std::exp(-lr)));
  if (L == 0.0) return elv_beta_df(w, d, c, upper, lower, &density);
  return elv_beta_ncdf2(w, d, c, L, upper, lower);
}

// Central F tails where a df is tiny, from the beta law (c, d) = (df1/2,
// df2/2) at y = c x/(d + c x) and w = d/(d + c x), both formed in
// logarithms from ln(c x/d) (c x may overflow, y or w fall below the normal
// range). A half df below the normal range (which the armed state reads as
// 0) is taken doubled: to first order in it the tail at the far end from it
// is proportional to it (halved afterwards), and with both halves that small
// the tails depend on their ratio only.
bool tinyDfFTails(double x, double df1, double df2, double* lower, double* upper) {
  if (!(df1 >= DBL_MIN && df2 >= DBL_MIN && x >= DBL_MIN) || std::isinf(x)) return false;
  double c = 0.5 * df1, d = 0.5 * df2;
  const bool cDoubled = !(c >= DBL_MIN), dDoubled = !(d >= DBL_MIN);
  if (cDoubled) c = df1;
  if (dDoubled) d = df2;
  const double lr = std::log(df1) + std::log(x) - std::log(df2);
  // ln y = -ln(1 + e^-lr), ln w = -ln(1 + e^lr), each with exp of a
  // non-positive argument.
  const double ly = lr <= 0.0 ? lr - std::log1p(std::exp(lr)) : -std::log1p(std::exp(-lr));
  const double lw = lr >= 0.0 ? -lr - std::log1p(std::exp(-lr)) : -std::log1p(std::exp(lr));
  const auto expOrZero = [](double v) { return v < -708.39 ? 0.0 : std::exp(v); };
  if (!smallshape::betaTails(c, d, expOrZero(ly), ly, expOrZero(lw), lw, lower, upper)) {
    return false;
  }
  if (cDoubled != dDoubled) {
    double* proportional = cDoubled ? upper : lower;
    *proportional *= 0.5;
    *(cDoubled ? lower : upper) = 0.5 + (0.5 - *proportional);
  }
  return true;
}

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
  // A tiny shape or argument: the series in logarithms (small_shape_tails.h).
  if (std::islessequal(a, smallshape::kTinyShape) || std::islessequal(b, smallshape::kTinyShape) ||
      x < smallshape::kTinyArgument) {
    const double lx = std::log(x), ly = std::log1p(-x);
    if (std::fmin(a, b) <= smallshape::kTinyShape
            ? smallshape::betaTails(a, b, x, lx, 0.5 + (0.5 - x), ly, &lower, &upper)
            : smallshape::betaTailsAtTinyArgument(a, b, x, lx, &lower, &upper)) {
      return upperTail ? upper : lower;
    }
  }
  if (betaratio::fastTails(a, b, x, 0.5 + (0.5 - x), &lower, &upper)) {
    return upperTail ? upper : lower;
  }
  if (ElvFailed(elv_beta_df(x, a, b, &lower, &upper, &density)) &&
      !betaratio::anyTails(a, b, x, 0.5 + (0.5 - x), &lower, &upper)) {
    return mGetMissingValueCode();
  }
  return upperTail ? upper : lower;
}

namespace {

// Both shapes beyond this and the ELV quantile routines refused: the search
// below. (Their shapes end near 9.5e7.)
constexpr double kLargeBetaShape = 1e6;

// The beta quantile at large shapes, 0 < p < 1: the search on BRATIO's tails
// (basym there, TOMS 708) from the Cornish-Fisher start m + sd (z + (z^2 - 1)
// skew / 6), by first steps of a standard deviation in the logit.
double largeShapeBetaQuantile(double p, double a, double b) {
  const TailPair tails = [a, b](double x, double* lower, double* upper) {
    return betaratio::anyTails(a, b, x, 0.5 + (0.5 - x), lower, upper);
  };
  const double n = a + b, m = a / n, y = b / n;
  const double sd = std::sqrt(m * y / (n + 1.0));
  const double skew = 2.0 * (y - m) / (n + 2.0) / sd;
  const double z = elv::normalQuantile(p);
  double start = m + sd * (z + (z * z - 1.0) * skew / 6.0);
  if (!(start > 0.0 && start < 1.0)) start = m;
  const double logit = std::fabs(std::log(m) - std::log1p(-m));
  const double step = std::fmax(0.5 * sd / (m * y), 8.0 * DBL_EPSILON * std::fmax(1.0, logit));
  return mTailQuantile(tails, p, TailSupport::Unit, start, step);
}

}  // namespace

double mBetaInvCdf(double p, double a, double b) {
  if (!mPositiveShapes(a, b)) return mGetMissingValueCode();
  if (p == 0.0) return 0.0;
  if (p == 1.0) return 1.0;
  // Both tails through mBetaCdf (the series of small_shape_tails.h at tiny
  // shapes); the search settles the ends first: 0 below DBL_MIN, 1 above the
  // largest double below 1.
  const TailPair cdfTails = [a, b](double x, double* lower, double* upper) {
    *lower = mBetaCdf(x, a, b, false);
    *upper = mBetaCdf(x, a, b, true);
    return !mIsNumericMissing(*lower) && !mIsNumericMissing(*upper);
  };
  if ((std::islessequal(a, smallshape::kTinyShape) ||
       std::islessequal(b, smallshape::kTinyShape)) &&
      p > 0.0 && p < 1.0) {
    return smallshape::quantile(cdfTails, p, TailSupport::Unit, 0.5);
  }
  double q = 0.0;
  if (seriesquantile::betaQuantile(p, a, b, &q)) return q;
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
  if (std::isgreater(std::fmin(a, b), kLargeBetaShape)) return largeShapeBetaQuantile(p, a, b);
  // Beyond the routines' range of tails: the smaller tail in logarithms.
  const double x = mTailQuantile(tails, p, TailSupport::Unit, a / (a + b));
  if (!mIsNumericMissing(x) || !(p > 0.0 && p < 1.0)) return x;
  // A quantile that rounds to an end (b = 1e-4 puts the mass of p = 0.3
  // within 1e-16 of 1) has no bracket inside (0, 1): the end search answers.
  return smallshape::quantile(cdfTails, p, TailSupport::Unit, 0.5);
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

constexpr double kLargeMixtureDf = 1e5;

// df1 x + df2 without overflow (a trap in the armed state).
bool productsFit(double x, double df1, double df2) {
  return x <= 0.25 * DBL_MAX / df1 && df2 <= 0.25 * DBL_MAX;
}

bool chiSqLimit(double df1, double df2) {
  // df2 >= 1e18 max(1, df1^2), without squaring df1 (an overflow trap).
  return df2 >= 1e18 && std::isfinite(df2) && df1 <= std::fmax(1.0, std::sqrt(df2 * 1e-18));
}
// Both df beyond this and the ELV routines refused: the large-df routes.
constexpr double kLargeFDf = 1e8;

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
  if (noncentrality == 0.0 &&
      (std::islessequal(df1, 2.0 * smallshape::kTinyShape) ||
       std::islessequal(df2, 2.0 * smallshape::kTinyShape)) &&
      tinyDfFTails(x, df1, df2, lower, upper)) {
    return true;
  }
  if (tinyBetaArgument(x, df1, df2, noncentrality, lower, upper)) {
    if (!std::isnan(*lower)) return true;
    *lower = *upper = mGetMissingValueCode();
    return false;
  }
  // df2 beyond 1e18 df1^2: df1 F is chi-square on df1 to O(df1^2 / df2)
  // relative (E[chi2_df2 / df2] = 1, so the first-order term vanishes),
  // where y = df1 x / (df1 x + df2) would have lost the digits of x.
  if (noncentrality == 0.0 && chiSqLimit(df1, df2) && productsFit(x, df1, df2)) {
    if (gammaratio::tails(0.5 * df1, 0.5 * df1 * x, lower, upper)) return true;
  }
  // Central: I_z(df1/2, df2/2) at z = df1 x/(df1 x + df2), whose complement
  // df2/(df1 x + df2) is formed apart (TOMS 708).
  if (noncentrality == 0.0 && centralFArgumentsFit(x, df1, df2)) {
    const double scaled = df1 * x, sum = scaled + df2;
    if (std::isfinite(sum) &&
        betaratio::fastTails(df1 / 2.0, df2 / 2.0, scaled / sum, df2 / sum, lower, upper)) {
      return true;
    }
  }
  if (noncentrality == 0.0 && std::fmin(df1, df2) > kLargeFDf && productsFit(x, df1, df2)) {
    // Beyond the ELV routine's df, BRATIO's deep tails too (no other route).
    const double scaled = df1 * x, sum = scaled + df2;
    if (betaratio::anyTails(df1 / 2.0, df2 / 2.0, scaled / sum, df2 / sum, lower, upper)) {
      return true;
    }
  }
  // Large df: the chained mixture, which keeps the digits the ELV routine's
  // noncentral F loses there (2e-13 in the body, 1e-10 in the far tails at
  // df 1e6).
  if (noncentrality > 0.0 && df1 + df2 > kLargeMixtureDf &&
      large::noncentralFTails(x, df1, df2, noncentrality, lower, upper)) {
    return true;
  }
  const ElvStatus status = x > kLargestFArgument
                               ? betaMixtureTails(x, df1, df2, noncentrality, lower, upper)
                               : elv_F_ncdf(x, df1, df2, noncentrality, lower, upper);
  if (ElvFailed(status) &&
      !(noncentrality > 0.0 && large::noncentralFTails(x, df1, df2, noncentrality, lower, upper))) {
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
  // A small df1 puts mass below the smallest normal double (all but
  // 4e-14 of it at df1 = 1e-16; e^(-L/2) of it for a noncentral F, whose
  // component j = 0 rises like x^(df1/2)): quantiles of p up to that mass
  // are 0 to double precision.
  double lowest = 0.0, above = 0.0;
  if (mFCdf(DBL_MIN, df1, df2, noncentrality, &lowest, &above) && p <= lowest) return 0.0;
  if (noncentrality == 0.0 && (std::islessequal(df1, 2.0 * smallshape::kTinyShape) ||
                               std::islessequal(df2, 2.0 * smallshape::kTinyShape))) {
    // A tiny df: the tails of mFCdf, which keep the mass of the order of it.
    const TailPair tails = [df1, df2](double x, double* lower, double* upper) {
      return mFCdf(x, df1, df2, 0.0, lower, upper);
    };
    return smallshape::quantile(tails, p, TailSupport::Positive, 1.0);
  }
  if (noncentrality == 0.0 && chiSqLimit(df1, df2) && p > 0.0 && p < 1.0) {
    const double q = mGammaInvCdf(p, 0.5 * df1, 2.0 / df1, 0.0);  // chi2_df1 / df1
    if (!mIsNumericMissing(q)) return q;
  }
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
    if (std::fmin(df1, df2) > kLargeFDf && p > 0.0 && p < 1.0) {
      // Large df: ln F is about normal with variance 2/df1 + 2/df2; the
      // search on mFCdf's tails from there, by steps of that spread.
      const TailPair exact = [df1, df2](double x, double* lower, double* upper) {
        return mFCdf(x, df1, df2, 0.0, lower, upper);
      };
      const double sd = std::sqrt(2.0 / df1 + 2.0 / df2);
      const double start = std::exp(sd * elv::normalQuantile(p));
      return mTailQuantile(exact, p, TailSupport::Positive, start,
                           std::fmax(0.5 * sd, 8.0 * DBL_EPSILON));
    }
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
