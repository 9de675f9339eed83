// Normal, log-normal and half-normal distributions on the ELV normal
// routines. At full precision the tails and the quantile come straight from
// the double-precision normal tail and AS 241 (normal_precise.h), over the
// whole range of doubles. The historical setting goes through the ELV
// routines, and its quantile falls back on a search of the distribution
// function over [-36, 0] where the ELV inverse refuses p.
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/pvalue.h"
#include "utilities/distributions/standardize.h"
#include "utilities/elv/normal_precise.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/wrappers.h"

namespace qel {

namespace {

constexpr double kSearchLowerEnd = -36.0;

// The standard normal quantile, or the missing value.
double standardNormalQuantile(double p) {
  if (elv::elvPrecision() == elv::ElvPrecision::Full && p > 0.0 && p < 1.0) {
    return elv::normalQuantile(p);
  }
  double z = 0.0;
  if (!ElvFailed(elv_inv_normal_df(p, &z))) return z;
  double lower = 0.0, upper = 0.0;
  if (ElvFailed(elv_normal_df(kSearchLowerEnd, &lower, &upper))) return mGetMissingValueCode();
  if (lower > p || p > 0.5) return mGetMissingValueCode();
  CmStandardNormalCdf f(p);
  int status = 0;
  return mRootFinder(kSearchLowerEnd, 0.0, f, &status);
}

}  // namespace

// The search serves targets far below the default absolute tolerance for f
// (1e-30): convergence in f is judged relative to the target alone.
CmStandardNormalCdf::CmStandardNormalCdf(double p) : mP(p) {
  mTarget = p;
  mAbsoluteToleranceForX = kQuantileSearchToleranceX;
  mAbsoluteToleranceForF = 0.0;
}

double CmStandardNormalCdf::operator()(double x) {
  if (mIsNumericMissing(x)) return x;
  double lower = 0.0, upper = 0.0;
  if (ElvFailed(elv_normal_df(x, &lower, &upper))) return mGetMissingValueCode();
  return lower - mP;
}

// --- Normal ----------------------------------------------------------------

namespace {

// exp(t) / (sqrt(2 pi) scale) by mExpOverScale: the root joins the scale
// (the quotient may be near DBL_MAX while exp(t) / scale is above it),
// unless their product would overflow.
double normalDensityOverScale(double t, double scale) {
  const double root = std::sqrt(mGetPi() + mGetPi());
  return scale < 1e300 ? mExpOverScale(t, root * scale) : mExpOverScale(t, scale) / root;
}

}  // namespace

double mNormalPdf(double x, double mean, double sigma) {
  try {
    const double z = mStandardize(x, mean, sigma);
    return normalDensityOverScale(-z * z / 2.0, sigma);
  } catch (const std::runtime_error&) {
    return 0.0;
  }
}

bool mNormalCdf(double x, double mean, double sigma, double* lower, double* upper) {
  if (mIsNumericMissing(x)) {
    *lower = *upper = x;
    return false;
  }
  if (x == mean) {
    *lower = *upper = 0.5;
    return true;
  }
  if (elv::elvPrecision() == elv::ElvPrecision::Full) {
    // Both tails straight from the double-precision tail, which also serves
    // the tails below the ELV routine's underflow limit.
    const double z = mStandardize(x, mean, sigma);
    if (std::isnan(z)) {
      *lower = *upper = mGetMissingValueCode();
      return false;
    }
    const double small = elv::normalUpperTail(std::fabs(z));
    *(z >= 0.0 ? upper : lower) = small;
    *(z >= 0.0 ? lower : upper) = 1.0 - small;
    return true;
  }
  if (ElvFailed(elv_normal_df(mStandardize(x, mean, sigma), lower, upper))) {
    *lower = *upper = mGetMissingValueCode();
    return false;
  }
  return true;
}

double mNormalCdf(double x, double mean, double sigma, bool upperTail) {
  if (elv::elvPrecision() == elv::ElvPrecision::Full && !mIsNumericMissing(x) && x != mean) {
    // One tail only: the small one straight, the large one as its
    // complement.
    const double z = mStandardize(x, mean, sigma);
    if (!std::isnan(z)) {
      const double small = elv::normalUpperTail(std::fabs(z));
      return (z >= 0.0) == upperTail ? small : 1.0 - small;
    }
  }
  double lower = 0.0, upper = 0.0;
  mNormalCdf(x, mean, sigma, &lower, &upper);
  return upperTail ? upper : lower;
}

// A quantile beyond the double range (sigma near DBL_MAX) has no double:
// no answer.
double mNormalInvCdf(double p, double mean, double sigma) {
  const double z = elv::elvPrecision() == elv::ElvPrecision::Full && p > 0.0 && p < 1.0
                       ? elv::normalQuantile(p)
                       : standardNormalQuantile(p);
  if (mIsNumericMissing(z)) return z;
  try {
    return mean + sigma * z;
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mNormalPValue(double z, EAlternative alternative) {
  if (mIsNumericMissing(z)) return z;
  double lower = 0.5, upper = 0.5;
  if (z != 0.0 && ElvFailed(elv_normal_df(z, &lower, &upper))) return mGetMissingValueCode();
  return mPValueFromTails(lower, upper, alternative);
}

// Both one-sided alternatives give the same (upper) critical value.
double mNormalCritValue(double alpha, EAlternative alternative) {
  double p = 0.0;
  if (alternative == kAlternativeLess || alternative == kAlternativeGreater) {
    p = 1.0 - alpha;
  } else if (alternative == kAlternativeNotEqual) {
    p = 1.0 - alpha / 2.0;
  }
  return mNormalInvCdf(p, 0.0, 1.0);
}

// --- Log-normal --------------------------------------------------------------

double mLogNormalPdf(double x, double location, double scale, double threshold) {
  if (x <= threshold) return 0.0;
  try {
    // phi(z) / (scale (x - threshold)) with 1 / (x - threshold) = exp(-u)
    // inside the one exponential: the normal density alone may be a denormal
    // (read as zero in the armed state) where the quotient is not.
    const double u = mLogOfDifference(x, threshold);
    const double z = mStandardize(u, location, scale);
    if (std::fabs(z) > 1e150) return 0.0;
    return normalDensityOverScale(-z * z / 2.0 - u, scale);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mLogNormalCdf(double x, double location, double scale, double threshold, bool upperTail) {
  if (x <= threshold) return upperTail ? 1.0 : 0.0;
  try {
    return mNormalCdf(mLogOfDifference(x, threshold), location, scale, upperTail);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mLogNormalInvCdf(double p, double location, double scale, double threshold) {
  if (p == 0.0) return threshold;
  try {
    const double u = mNormalInvCdf(p, location, scale);
    if (mIsNumericMissing(u)) return u;
    return threshold + mExponential(u, true);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

// --- Half-normal -------------------------------------------------------------
// Arguments in the order (x, scale, location).

double mHalfNormalPdf(double x, double scale, double location) {
  if (x < location) return 0.0;
  return 2.0 * mNormalPdf(x, location, scale);
}

// Lower tail 2 Phi(z) - 1 = erf(z / sqrt 2), upper tail 2 Phi(-z) =
// erfc(z / sqrt 2). At full precision each tail is formed on its own: the
// upper tail is the normal's upper tail doubled (exact), the lower tail the C
// library's erf (within an ulp; the TOMS 708 erf is 6 ulp off below 0.5)
// below z = 1 and the complement of the upper tail above, where
// 2 Phi(-z) < 0.32 leaves 1 - 2 Phi(-z) its digits. The written complement
// 1 - (2 Phi(z) - 1) loses them: 1.5e-10 relative at z = 5. A missing Phi is
// carried through the written arithmetic.
double mHalfNormalCdf(double x, double scale, double location, bool upperTail) {
  if (elv::elvPrecision() == elv::ElvPrecision::Full && !mIsNumericMissing(x) && x > location) {
    const double z = mStandardize(x, location, scale);
    if (!std::isnan(z)) {
      const double upper = 2.0 * elv::normalUpperTail(z);
      if (upperTail) return upper;
      return z < 1.0 ? std::erf(z * M_SQRT1_2) : 1.0 - upper;
    }
  }
  double lower = 0.0;
  if (x >= location) lower = 2.0 * mNormalCdf(x, location, scale, false) - 1.0;
  return upperTail ? 1.0 - lower : lower;
}

namespace {

// z with erf(z / sqrt 2) = p, 0 < p < 0.5: Newton steps on the C library's erf from
// the normal quantile of (1 + p)/2, whose rounding leaves about 1e-16/p
// relative error in the start; each step squares it. At p near DBL_MIN the
// start is 0 and the first step lands on the linear term p sqrt(pi/2).
double halfNormalSmallQuantile(double p) {
  // Below p = 1e-8, erf(z / sqrt 2) = z sqrt(2/pi) (1 - z^2/6) leaves z =
  // p sqrt(pi/2) to rounding; Newton there would form z / sqrt 2, a denormal
  // near p = DBL_MIN that the armed state reads as zero (2x the quantile).
  if (p < 1e-8) return p * 1.2533141373155002512;
  const double start = standardNormalQuantile((1.0 + p) / 2.0);
  if (mIsNumericMissing(start)) return start;
  double z = start;
  const double slope = 0.79788456080286535588;  // sqrt(2/pi)
  for (int step = 0; step < 4; ++step) {
    const double correction = (std::erf(z * M_SQRT1_2) - p) / (slope * std::exp(-0.5 * z * z));
    z -= correction;
    if (std::fabs(correction) <= 1e-17 * z) break;
  }
  return z;
}

}  // namespace

// At full precision the quantile keeps p's digits: p >= 0.5 from the normal
// quantile of (1 - p)/2 (exact arguments), below it by halfNormalSmallQuantile;
// the written (1 + p)/2 rounds away a small p's digits (8e-11 at p = 1e-6).
double mHalfNormalInvCdf(double p, double scale, double location) {
  double z;
  if (elv::elvPrecision() == elv::ElvPrecision::Full && p > 0.0 && p < 1.0) {
    z = p >= 0.5 ? -standardNormalQuantile((1.0 - p) / 2.0) : halfNormalSmallQuantile(p);
  } else {
    z = standardNormalQuantile((1.0 + p) / 2.0);
  }
  if (mIsNumericMissing(z)) return z;
  try {
    return location + scale * z;
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

}  // namespace qel
