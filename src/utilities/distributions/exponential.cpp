// Exponential, extreme-value (Gumbel), Weibull and Laplace distributions.
//
// All four rest on the exponential tails: with e = exp(-z) the upper tail is
// e itself, and the lower tail 1 - e is -expm1(-z), which keeps its relative
// accuracy for small z where the subtraction would cancel.
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/standardize.h"
#include "utilities/elv/wrappers.h"

namespace qel {

namespace {

// -ln(1 - p): by log1p below 1/2, where 1 - p would round away the digits
// of a small p; by the checked logarithm above (it refuses p = 1).
double minusLogComplement(double p) {
  if (p < 0.5) return -std::log1p(-p);
  return -mLog(1.0 - p, true);
}

// -ln(p): for p above 1/2 by log1p of the exact p - 1.
double minusLog(double p) {
  if (p > 0.5) return -std::log1p(p - 1.0);
  return -mLog(p, true);
}

// The largest extreme-value quantile location - scale ln(-ln p), with
// -ln p formed by minusLog (p) or minusLogComplement (of q = 1 - p) when the
// caller holds the exact complement.
double largestExtremeValueQuantile(double minusLogP, double location, double scale) {
  return location - scale * mLog(minusLogP, true);
}

}  // namespace

// --- Exponential -----------------------------------------------------------

double mExponentialPdf(double x, double scale, double threshold) {
  try {
    if (x < threshold) return 0.0;
    return mExpOverScale(-mStandardize(x, threshold, scale), scale);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mExponentialCdf(double x, double scale, double threshold, bool upperTail) {
  if (x <= threshold) return upperTail ? 1.0 : 0.0;
  try {
    const double z = mStandardize(x, threshold, scale);
    if (upperTail) return mExponential(-z, true);
    // 1 - exp(-z) by expm1: exact to rounding for every z, also where a
    // tiny z (x = 1e-300) would cancel to 0 in 1 - e.
    return -std::expm1(-z);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mExponentialInvCdf(double p, double scale, double threshold) {
  try {
    return threshold + scale * minusLogComplement(p);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

// --- Extreme value ---------------------------------------------------------

double mLargestExtremeValuePdf(double x, double location, double scale) {
  try {
    // e exp(-e) / scale; where e or exp(-e) would be a denormal, as the one
    // exponential exp(-z - e) (see mExpOverScale).
    const double z = mStandardize(x, location, scale);
    const double e = mExponential(-z, true);
    if (-z < -700.0 || e > 700.0) return mExpOverScale(-z - e, scale);
    return e * mExponential(-e, true) / scale;
  } catch (const std::runtime_error&) {
    return 0.0;
  }
}

// The lower tail exp(-e) is the upper tail of a unit exponential at e.
double mLargestExtremeValueCdf(double x, double location, double scale, bool upperTail) {
  try {
    const double e = mExponential(-mStandardize(x, location, scale), true);
    return mExponentialCdf(e, 1.0, 0.0, !upperTail);
  } catch (const std::runtime_error&) {
    // exp(-z) overflowed: x lies far below the location.
    return upperTail ? 1.0 : 0.0;
  }
}

double mLargestExtremeValueInvCdf(double p, double location, double scale) {
  try {
    return largestExtremeValueQuantile(minusLog(p), location, scale);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mSmallestExtremeValuePdf(double x, double location, double scale) {
  return mLargestExtremeValuePdf(-x, -location, scale);
}

double mSmallestExtremeValueCdf(double x, double location, double scale, bool upperTail) {
  return mLargestExtremeValueCdf(-x, -location, scale, !upperTail);
}

// The mirror of the largest extreme-value quantile at 1 - p. Its -ln(1 - p)
// is taken from p itself, which the caller holds exactly.
double mSmallestExtremeValueInvCdf(double p, double location, double scale) {
  double q;
  try {
    q = largestExtremeValueQuantile(minusLogComplement(p), -location, scale);
  } catch (const std::runtime_error&) {
    q = mGetMissingValueCode();
  }
  if (q >= mGetMissingValueCode()) return q;
  return -q;
}

// --- Weibull ---------------------------------------------------------------

namespace {

// log z for z = (x - threshold) / scale below DBL_MIN: z itself is a
// denormal or 0, which the armed state reads as zero, while z^shape may be
// of order one for a small shape. |log z| > 708 exceeds the rounding of the
// two logarithms (up to 1416 ulp of 1) by 708 to 1.
double logTinyStandardized(double x, double threshold, double scale) {
  return mLogOfDifference(x, threshold) - mLog(scale, true);
}

}  // namespace

// shape z^(shape - 1) exp(-z^shape) / scale; where that product or a factor
// of it is below DBL_MIN (a denormal, read as zero by the armed state) while
// the density need not be, it is formed as shape z^shape exp(-z^shape) /
// (x - threshold) in one exponential.
double mWeibullPdf(double x, double shape, double scale, double threshold) {
  if (x <= threshold) return 0.0;
  try {
    const double z = mStandardize(x, threshold, scale);
    if (!(z < DBL_MIN)) {
      const double zShape = mRaiseToPower(z, shape, true);
      const double density =
          shape * mExponential(-zShape, true) * mRaiseToPower(z, shape - 1.0, true) / scale;
      if (!(density < DBL_MIN)) return density;
    }
    const double logZShape =
        shape * (z < DBL_MIN ? logTinyStandardized(x, threshold, scale) : mLog(z, true));
    if (logZShape > 700.0) return 0.0;
    return mExponential(mLog(shape, true) + logZShape - mExponential(logZShape, true) -
                            mLogOfDifference(x, threshold),
                        true);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mWeibullCdf(double x, double shape, double scale, double threshold, bool upperTail) {
  if (x <= threshold) return upperTail ? 1.0 : 0.0;
  try {
    const double z = mStandardize(x, threshold, scale);
    const double zShape = z < DBL_MIN
                              ? mExponential(shape * logTinyStandardized(x, threshold, scale), true)
                              : mRaiseToPower(z, shape, true);
    return mExponentialCdf(zShape, 1.0, 0.0, upperTail);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mWeibullInvCdf(double p, double shape, double scale, double threshold) {
  if (p == 0.0) return threshold;
  if (p == 1.0) return mGetMissingValueCode();
  try {
    const double w = minusLogComplement(p);
    const double power = mRaiseToPower(w, 1.0 / shape, true);
    // A standard quantile below DBL_MIN is a denormal, zero to the armed
    // state, although times a large scale it may be normal: the scale joins
    // the power's exponent.
    if (power < DBL_MIN && w >= DBL_MIN && scale > 1.0) {
      return threshold + mExponential(mLog(scale, true) + mLog(w, true) / shape, true);
    }
    return threshold + scale * power;
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

// --- Laplace ---------------------------------------------------------------

double mLaplacePdf(double x, double location, double scale) {
  try {
    return 0.5 * mExpOverScale(-std::fabs(mStandardize(x, location, scale)), scale);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

// The tail beyond the location is half an exponential tail; the side that
// holds the location adds one half to half the exponential lower tail.
double mLaplaceCdf(double x, double location, double scale, bool upperTail) {
  try {
    double s = mStandardize(x, location, scale);
    if (upperTail) s = -s;
    if (s < 0.0) return 0.5 * mExponential(s, true);
    const double e = mExponentialCdf(s, 1.0, 0.0, false);
    if (mIsNumericMissing(e)) return e;
    return 0.5 + 0.5 * e;
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double mLaplaceInvCdf(double p, double location, double scale) {
  if (p == 0.0 || p == 1.0) return mGetMissingValueCode();
  if (mEqualWithinFuzz(p, 0.5, 0.0)) return location;
  try {
    if (p <= 0.5) return location + scale * mLog(2.0 * p, true);
    return location - scale * mLog(2.0 - 2.0 * p, true);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

}  // namespace qel
