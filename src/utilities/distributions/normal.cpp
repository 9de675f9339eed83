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

double mNormalPdf(double x, double mean, double sigma) {
  try {
    const double z = mStandardize(x, mean, sigma);
    return mExponential(-z * z / 2.0, true) / (std::sqrt(mGetPi() + mGetPi()) * sigma);
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
    const double u = mLog(x - threshold, true);
    return mNormalPdf(u, location, scale) / (x - threshold);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mLogNormalCdf(double x, double location, double scale, double threshold, bool upperTail) {
  if (x <= threshold) return upperTail ? 1.0 : 0.0;
  try {
    return mNormalCdf(mLog(x - threshold, true), location, scale, upperTail);
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

// Lower tail 2 Phi(z) - 1; the upper tail is its complement. A missing Phi
// is carried through the same arithmetic.
double mHalfNormalCdf(double x, double scale, double location, bool upperTail) {
  double lower = 0.0;
  if (x >= location) lower = 2.0 * mNormalCdf(x, location, scale, false) - 1.0;
  return upperTail ? 1.0 - lower : lower;
}

double mHalfNormalInvCdf(double p, double scale, double location) {
  const double z = standardNormalQuantile((1.0 + p) / 2.0);
  if (mIsNumericMissing(z)) return z;
  try {
    return location + scale * z;
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

}  // namespace qel
