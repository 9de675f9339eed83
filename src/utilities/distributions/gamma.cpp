// Gamma and chi-square distributions on the ELV gamma family.
//
// Quantiles come from the ELV quantile routines, which work from the nearer
// tail. A quantile whose lower tail misses p by more than 1e-9 p is refined
// by regula falsi (Illinois) on the distribution function, started on a
// bracket [0, q] that doubles until it holds p. Beyond the routines' range of
// tails, and for the noncentral chi-square, which has no quantile routine,
// the smaller tail is solved in logarithms (tail_quantile.h).
#include <cfloat>
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/gamma_ratio.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/large_parameters.h"
#include "utilities/distributions/log_gamma.h"
#include "utilities/distributions/pvalue.h"
#include "utilities/distributions/saddle_density.h"
#include "utilities/distributions/series_quantile.h"
#include "utilities/distributions/small_shape_quantile.h"
#include "utilities/distributions/small_shape_tails.h"
#include "utilities/distributions/standardize.h"
#include "utilities/distributions/tail_quantile.h"
#include "utilities/elv/limits.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/wrappers.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

namespace {

constexpr double kQuantileCheck = 1e-9;
constexpr double kNoncentralSearchStart = 1e30;

// Doubles [x1, x2] from x1 = 0 until f(x2) >= 0, then finds the root; the
// missing value when f has no value on the way or there is no root.
double searchUpwardFromZero(CmRealFunction& f, double start) {
  double x1 = 0.0;
  double x2 = start;
  for (;;) {
    const double f2 = f(x2);
    if (mIsNumericMissing(f2)) return f2;
    if (f2 >= 0.0) break;
    x1 = x2;
    x2 += x2;
  }
  int status = 0;
  return mRootFinder(x1, x2, f, &status);
}

// The ELV quantile routines take tails from 1e-12 on; beyond, the answer is
// searched from the quantile at that limit.
constexpr double kElvSmallestTail = 1e-12;

double clampToElvRange(double p) {
  return p <= 0.5 ? std::fmax(p, kElvSmallestTail) : std::fmin(p, 1.0 - kElvSmallestTail);
}

bool farBeyondElvRange(double p) {
  return p > 0.0 && p < 1.0 && (p < kElvSmallestTail || 1.0 - p < kElvSmallestTail);
}

double gammaElvQuantile(double p, double shape) {
  double q = 0.0;
  const ElvStatus status =
      p <= 0.5 ? elv_gamma_lower_quant(p, shape, &q) : elv_gamma_upper_quant(1.0 - p, shape, &q);
  return ElvFailed(status) ? mGetMissingValueCode() : q;
}

// The standard gamma quantile by the ELV routine for the nearer tail; tails
// beyond its range by the tail search started from its range limit.
double gammaQuantileFromElv(double p, double shape) {
  if (!mPositiveShapes(shape)) return mGetMissingValueCode();
  // The fast kernel's tails where it answers: for a small shape the quantile
  // magnifies a tail's relative error by 1/shape.
  const TailPair tails = [shape](double x, double* lower, double* upper) {
    if (gammaratio::fastTails(shape, x, lower, upper)) return true;
    double density = 0.0;
    return !ElvFailed(elv_gamma_df(x, shape, lower, upper, &density));
  };
  if (!farBeyondElvRange(p)) {
    const double q = gammaElvQuantile(p, shape);
    // The routine's Newton iteration may stop short of its tolerance
    // (status 4: at shape 0.05 for the quantile 1.0); at full precision
    // the tail search answers instead of the missing value.
    if (!mIsNumericMissing(q) || elv::elvPrecision() != elv::ElvPrecision::Full) {
      return mPolishedQuantile(tails, p, TailSupport::Positive, q);
    }
    return mTailQuantile(tails, p, TailSupport::Positive, shape);
  }
  double start = gammaElvQuantile(clampToElvRange(p), shape);
  if (mIsNumericMissing(start) || !(start > 0.0)) start = shape;
  return mTailQuantile(tails, p, TailSupport::Positive, start);
}

double chiSqQuantileFromElv(double p, double df) {
  if (farBeyondElvRange(p) || elv::elvPrecision() == elv::ElvPrecision::Full) {
    const double half = gammaQuantileFromElv(p, df / 2.0);
    return mIsNumericMissing(half) ? half : 2.0 * half;
  }
  double q = 0.0;
  const ElvStatus status =
      p <= 0.5 ? elv_chi2_lower_quant(p, df, &q) : elv_chi2_upper_quant(1.0 - p, df, &q);
  return ElvFailed(status) ? mGetMissingValueCode() : q;
}

// The standard gamma quantile at a shape beyond the ELV routines, 0 < p < 1:
// the search on the tails of gamma_ratio.h (Temme's expansion there) from
// the Wilson-Hilferty start, by first steps of a standard deviation of ln X.
// It resolves the quantile to the last unit of x, so no check follows.
double largeShapeGammaQuantile(double p, double shape) {
  const TailPair tails = [shape](double x, double* lower, double* upper) {
    return gammaratio::tails(shape, x, lower, upper);
  };
  const double start = large::gammaQuantileStart(p, shape);
  return mTailQuantile(tails, p, TailSupport::Positive, start > 0.0 ? start : shape,
                       large::logStep(shape));
}

bool largeShape(double shape, double p) {
  return std::isgreater(shape, elv::kMaxShape) && p > 0.0 && p < 1.0;
}

// True when the lower tail F(q) is within 1e-9 p of p.
bool quantileIsClose(CmRealFunction& f, double q, double p) {
  const double error = f(q);
  return !mIsNumericMissing(error) && std::fabs(error) <= kQuantileCheck * p;
}

// A central chi-square quantile with the check and refinement.
double centralChiSqQuantile(double p, double df) {
  const double q = chiSqQuantileFromElv(p, df);
  if (mIsNumericMissing(q) || q == 0.0) return q;
  CmChiSqCdf f(df, 0.0, p);
  if (quantileIsClose(f, q, p)) return q;
  return searchUpwardFromZero(f, q);
}

// Both tails at a tiny shape or a tiny standardized argument z = (x -
// threshold)/scale, whose logarithm is taken from x, the threshold and the
// scale where z itself falls below the normal range (the armed state reads
// such a z as 0).
bool smallShapeGammaTails(double shape, double z, double x, double scale, double threshold,
                          double* lower, double* upper) {
  double lz;
  if (z >= DBL_MIN) {
    lz = std::log(z);
  } else if (x > threshold && scale >= DBL_MIN && std::isfinite(scale)) {
    lz = mLogOfDifference(x, threshold) - std::log(scale);
  } else {
    return false;
  }
  return smallshape::gammaTails(shape, z, lz, lower, upper);
}

// The quantile on the caller's scale, q scale + threshold, or NaN where it
// lies beyond the double range.
double scaledQuantile(double q, double scale, double threshold) {
  if (q > 1.0 && scale > DBL_MAX / q) return mQuietNaN();
  const double v = q * scale;
  if ((v > 0.0) == (threshold > 0.0) && std::fabs(threshold) > DBL_MAX - std::fabs(v)) {
    return mQuietNaN();
  }
  return v + threshold;
}

// The standard gamma quantile at a tiny shape, 0 < p < 1, on the series
// tails of small_shape_tails.h (the ELV routines start from tails that have
// lost the mass of the order of the shape).
double smallShapeGammaQuantile(double p, double shape) {
  const TailPair tails = [shape](double x, double* lower, double* upper) {
    return x >= DBL_MIN && x <= DBL_MAX &&
           smallshape::gammaTails(shape, x, std::log(x), lower, upper);
  };
  return smallshape::quantile(tails, p, TailSupport::Positive, 1.0);
}

bool tinyGammaShape(double shape, double p) {
  return std::islessequal(shape, smallshape::kTinyShape) && shape >= DBL_MIN && p > 0.0 && p < 1.0;
}

// Both tails of the noncentral chi-square at df <= 2e-5 as the Poisson
// mixtures sum_j W(j) P(df/2 + j, x/2) and sum_j W(j) Q(df/2 + j, x/2),
// W(j) = e^-L L^j/j!, L = noncentrality/2, each a sum of positive terms with
// both ratios taken directly (the tiny-shape series for j = 0): the ELV
// routine forms the upper tail as a complement (2e-14 off at x = 1e-10).
// False for L > 1e4 (long sums) or where a ratio is out of reach.
bool tinyDfNoncentralChiSq(double x, double df, double noncentrality, double* lower,
                           double* upper) {
  const double L = 0.5 * noncentrality, z = 0.5 * x;
  if (!(df >= 2.0 * DBL_MIN && df <= 2.0 * smallshape::kTinyShape && L > 0.0 && L <= 1e4 &&
        z >= DBL_MIN && std::isfinite(z))) {
    return false;
  }
  const double spread = 40.0 * std::sqrt(L) + 40.0, lz = std::log(z);
  double lo = 0.0, up = 0.0;
  for (double j = std::max(0.0, std::floor(L - spread)); j <= L + spread; j += 1.0) {
    const double a = 0.5 * df + j;
    double p = 0.0, q = 0.0;
    if (j == 0.0) {
      if (!smallshape::gammaTails(a, z, lz, &p, &q)) return false;
    } else if (!gammaratio::tails(a, z, &p, &q)) {
      // The direct tail lies below 1e-280: the one on the side of z.
      p = z < a ? 0.0 : 1.0;
      q = 1.0 - p;
    }
    const double w = saddle::poissonMass(j, L);
    lo += w * p;
    up += w * q;
  }
  *lower = std::min(lo, 1.0);
  *upper = std::min(up, 1.0);
  return true;
}

}  // namespace

// --- Function objects ------------------------------------------------------

CmGammaCdf::CmGammaCdf(double shape, double p) : mShape(shape), mP(p) {
  mTarget = p;
  mAbsoluteToleranceForX = kQuantileSearchToleranceX;
}

double CmGammaCdf::operator()(double x) {
  if (mIsNumericMissing(x)) return x;
  if (x <= 0.0) return -mP;
  double lower = 0.0, upper = 0.0, density = 0.0;
  if (ElvFailed(elv_gamma_df(x, mShape, &lower, &upper, &density))) return mGetMissingValueCode();
  return lower - mP;
}

CmChiSqCdf::CmChiSqCdf(double df, double noncentrality, double p)
    : mDf(df), mNoncentrality(noncentrality), mP(p) {
  mTarget = p;
  mAbsoluteToleranceForX = kQuantileSearchToleranceX;
}

double CmChiSqCdf::operator()(double x) {
  if (mIsNumericMissing(x)) return x;
  if (x <= 0.0) return -mP;
  double lower = 0.0, upper = 0.0;
  if (ElvFailed(elv_chi2_ncdf(x, mDf, mNoncentrality, &lower, &upper)) &&
      !mChiSqCdf(x, mDf, mNoncentrality, &lower, &upper)) {
    return mGetMissingValueCode();
  }
  return lower - mP;
}

// --- Gamma -----------------------------------------------------------------

double mGammaPdf(double x, double shape, double scale, double threshold) {
  if (x <= threshold) return 0.0;
  // Loader's saddle-point form keeps the density's digits for large shapes;
  // a distance x - threshold beyond DBL_MAX leaves a density of 0. The
  // distance is halved only where it could overflow: half of an x near
  // DBL_MIN is a denormal, which the armed state reads as zero.
  double distance = x - threshold;
  if (std::fabs(x) > 0.5 * DBL_MAX || std::fabs(threshold) > 0.5 * DBL_MAX) {
    const double half = 0.5 * x - 0.5 * threshold;
    if (half > 0.5 * DBL_MAX) return 0.0;
    distance = 2.0 * half;
  }
  try {
    // A distance below DBL_MIN (read as zero) goes in with the scale, both
    // times 2^106; the density per unit of the smaller scale is 2^106 times
    // as large.
    if (distance < DBL_MIN && scale < 1e250) {
      return saddle::gammaDensity(x * 0x1p106 - threshold * 0x1p106, shape, scale * 0x1p106) *
             0x1p106;
    }
    return saddle::gammaDensity(distance, shape, scale);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  } catch (const std::invalid_argument&) {
    return mGetMissingValueCode();
  }
}

double mGammaCdf(double x, double shape, double scale, double threshold, bool upperTail) {
  if (x < threshold) return upperTail ? 1.0 : 0.0;
  double lower = 0.0, upper = 0.0, density = 0.0;
  const double z = mStandardize(x, threshold, scale);
  if ((std::islessequal(shape, smallshape::kTinyShape) ||
       std::isless(z, smallshape::kTinyArgument)) &&
      smallShapeGammaTails(shape, z, x, scale, threshold, &lower, &upper)) {
    return upperTail ? upper : lower;
  }
  if (gammaratio::fastTails(shape, z, &lower, &upper)) return upperTail ? upper : lower;
  if (ElvFailed(elv_gamma_df(z, shape, &lower, &upper, &density))) return mGetMissingValueCode();
  return upperTail ? upper : lower;
}

// A quantile of 0 comes back as 0.0 without the threshold: callers rely on
// this value as it stands.
double mGammaInvCdf(double p, double shape, double scale, double threshold) {
  double q = 0.0;
  if (tinyGammaShape(shape, p)) {
    q = smallShapeGammaQuantile(p, shape);
    return mIsNumericMissing(q) || q == 0.0 ? q : scaledQuantile(q, scale, threshold);
  }
  if (seriesquantile::gammaQuantile(p, shape, &q)) {
    return q == 0.0 ? q : scaledQuantile(q, scale, threshold);
  }
  if (largeShape(shape, p)) {
    q = largeShapeGammaQuantile(p, shape);
    return mIsNumericMissing(q) ? q : scaledQuantile(q, scale, threshold);
  }
  if (p != 0.0) {
    q = gammaQuantileFromElv(p, shape);
    if (mIsNumericMissing(q)) return q;
  }
  if (q == 0.0) return 0.0;
  CmGammaCdf f(shape, p);
  if (!quantileIsClose(f, q, p)) {
    q = searchUpwardFromZero(f, q);
    if (mIsNumericMissing(q)) return q;
  }
  return scaledQuantile(q, scale, threshold);
}

double mGammaInvCdfByRootFinder(double p, double shape, double start) {
  CmGammaCdf f(shape, p);
  return searchUpwardFromZero(f, start);
}

// --- Chi-square ------------------------------------------------------------

double mChiSqPdf(double x, double df) {
  if (x <= 0.0) return 0.0;
  // Below df = 2 DBL_MIN the shape df/2 is a denormal, zero to the armed
  // state. There 1/Gamma(a) = a (1 + O(a)), x^a = 2^a = 1 to within |a ln x|
  // < 1e-305: the density is (df/2) exp(-x/2) / x.
  if (df < 2.0 * DBL_MIN) return 0.5 * (df / x) * mExponential(-0.5 * x, false);
  try {
    return saddle::gammaDensity(x, df / 2.0, 2.0);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  } catch (const std::invalid_argument&) {
    return mGetMissingValueCode();
  }
}

bool mChiSqCdf(double x, double df, double noncentrality, double* lower, double* upper) {
  if (mIsNumericMissing(x)) {
    *lower = *upper = x;
    return false;
  }
  if (x <= 0.0) {
    *lower = 0.0;
    *upper = 1.0;
    return true;
  }
  if (noncentrality == 0.0 &&
      (std::islessequal(df, 2.0 * smallshape::kTinyShape) || x < 2.0 * smallshape::kTinyArgument) &&
      smallShapeGammaTails(df < 2.0 * DBL_MIN ? df : df / 2.0, x / 2.0, x, 2.0, 0.0, lower,
                           upper)) {
    if (df < 2.0 * DBL_MIN) {
      // df/2 below the normal range (read as 0 when armed), taken doubled:
      // the upper tail is proportional to the shape to first order.
      *upper *= 0.5;
      *lower = 0.5 + (0.5 - *upper);
    }
    return true;
  }
  if (noncentrality == 0.0 && gammaratio::fastTails(df / 2.0, x / 2.0, lower, upper)) return true;
  if (noncentrality > 0.0 && tinyDfNoncentralChiSq(x, df, noncentrality, lower, upper)) return true;
  if (noncentrality > 0.0 && x < 2.0 * smallshape::kTinyArgument && df >= 2.0 * DBL_MIN &&
      smallShapeGammaTails(df / 2.0, x / 2.0, x, 2.0, true, lower, upper)) {
    // Below 2e-280 only the first term of the Poisson mixture
    // sum_j e^-L L^j/j! P(df/2 + j, x/2), L = noncentrality/2, counts (the
    // next is smaller by x L/(df + 2)); the ELV routine underflows there.
    const double L = 0.5 * noncentrality;
    const double weight = L > 708.0 ? 0.0 : std::exp(-L);
    *lower *= weight;
    *upper = -std::expm1(-L) + weight * *upper;
    return true;
  }
  if (ElvFailed(elv_chi2_ncdf(x, df, noncentrality, lower, upper)) &&
      !large::noncentralChiSqTails(x, df, noncentrality, lower, upper)) {
    *lower = *upper = mGetMissingValueCode();
    return false;
  }
  return true;
}

double mChiSqCdf(double x, double df, double noncentrality, bool upperTail) {
  double lower = 0.0, upper = 0.0;
  mChiSqCdf(x, df, noncentrality, &lower, &upper);
  return upperTail ? upper : lower;
}

double mChiSqInvCdf(double p, double df, double noncentrality) {
  if (!mPositiveShapes(df) || !std::isgreaterequal(noncentrality, 0.0)) {
    return mGetMissingValueCode();
  }
  if (p == 0.0) return 0.0;
  if (p == 1.0) return mGetMissingValueCode();
  if (noncentrality == 0.0 && tinyGammaShape(df / 2.0, p)) {
    const double half = smallShapeGammaQuantile(p, df / 2.0);
    return mIsNumericMissing(half) ? half : scaledQuantile(half, 2.0, 0.0);
  }
  double half = 0.0;
  if (noncentrality == 0.0 && seriesquantile::gammaQuantile(p, df / 2.0, &half)) {
    return 2.0 * half;
  }
  if (noncentrality == 0.0 && largeShape(0.5 * df, p)) {
    const double large = largeShapeGammaQuantile(p, 0.5 * df);
    return mIsNumericMissing(large) ? large : scaledQuantile(large, 2.0, 0.0);
  }
  if (noncentrality == 0.0) return centralChiSqQuantile(p, df);
  // The smaller tail, solved in logarithms from the mean.
  const TailPair tails = [df, noncentrality](double x, double* lower, double* upper) {
    return mChiSqCdf(x, df, noncentrality, lower, upper);
  };
  // From the mean; at large df by steps of a standard deviation of log X.
  const double mean = df + noncentrality;
  return mTailQuantile(tails, p, TailSupport::Positive, mean,
                       mean > 1e6 ? large::logStep(0.5 * mean) : 1.0);
}

double mChiSqInvCdfByRootFinder(double p, double df, double noncentrality, double start) {
  CmChiSqCdf f(df, noncentrality, p);
  return searchUpwardFromZero(f, start);
}

double mChiSqPValue(double x, double df, EAlternative alternative) {
  double lower = 0.0, upper = 0.0;
  if (!mChiSqCdf(x, df, 0.0, &lower, &upper)) return mGetMissingValueCode();
  return mPValueFromTails(lower, upper, alternative);
}

// Only the one-sided critical values exist: the two-sided case is 0.0.
double mChiSqCritValue(double alpha, double df, EAlternative alternative) {
  if (alternative == kAlternativeGreater) return mChiSqInvCdf(1.0 - alpha, df, 0.0);
  if (alternative == kAlternativeLess) return mChiSqInvCdf(alpha, df, 0.0);
  return 0.0;
}

}  // namespace qel
