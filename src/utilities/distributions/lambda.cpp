// Tukey's lambda distribution.
//
// The family is defined by its quantile function
//   Q(p) = (p^lambda - (1 - p)^lambda) / lambda,
// with the logistic distribution as the limit lambda -> 0, the uniform on
// [-1, 1] at lambda = 1 and the uniform on [-1/2, 1/2] at lambda = 2. The
// distribution function has no closed form in general: it is the root in p
// of Q(p) = z, and the density is 1/Q'(p) at that root. For lambda > 0 the
// support is [-1/lambda, 1/lambda]; for lambda < 0 it is the real line. The distribution is
// symmetric, so the upper tail at z is the lower tail at -z, computed in its own right.
#include <cfloat>
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/standardize.h"

namespace qel {

namespace {

bool isLogisticLimit(double lambda) {
  return std::fabs(lambda) <= mGetEps(false);
}

// Q(p) = (p^lambda - (1 - p)^lambda) / lambda. For a small lambda both powers
// lie within |lambda ln p| of 1 and their rounded difference costs eps /
// |lambda| in Q (4e-7 at lambda = -5.7e-10: the lower tail at z = 1e-20 came
// out 0.50000004). Written as (1 - p)^lambda expm1(lambda L) / lambda with
// the logit L = ln(p / (1 - p)), from log1p((2p - 1) / (1 - p)) near p =
// 1/2 (2p - 1 and 1 - p are exact there), Q keeps its relative accuracy.
double lambdaTransform(double p, double lambda) {
  if (std::fabs(lambda) < 1e-3 && p > 0.0 && p < 1.0) {
    const double logit = p > 0.25 && p < 0.75 ? std::log1p((2.0 * p - 1.0) / (1.0 - p))
                                              : std::log(p) - std::log1p(-p);
    return std::exp(lambda * std::log1p(-p)) * (std::expm1(lambda * logit) / lambda);
  }
  return (mRaiseToPower(p, lambda, true) - mRaiseToPower(1.0 - p, lambda, true)) / lambda;
}

// For lambda < 0 the support is the real line and Q has poles at 0 and 1,
// so the root is bracketed inside (0, 1). For p <= 1/2 the term
// -(1 - p)^lambda / lambda lies in (0, c] with c = 2^-lambda / -lambda, so
// Q(p) >= p^lambda / lambda and Q(edge) <= z - c + c = z at
// edge = (lambda (z - c))^(1/lambda), for z <= 0. The positive side mirrors it.
// Returns false when the tail is beyond the double range (edge 0).
bool negativeLambdaBracket(double z, double lambda, double* a, double* b) {
  const double c = mRaiseToPower(2.0, -lambda, true) / -lambda;
  const double edge = mRaiseToPower(lambda * (-std::fabs(z) - c), 1.0 / lambda, true);
  if (z <= 0.0) {
    *a = edge;
    *b = 0.5;
    return edge > 0.0;
  }
  *a = 0.5;
  *b = 1.0 - edge;
  return *b < 1.0;
}

// The bracketing search stops on a small function value, which leaves p
// some 1e-13 off; Newton steps on Q(p) - z with Q'(p) = p^(lambda - 1) +
// (1 - p)^(lambda - 1) bring it to the last digits. A step that leaves the
// bracket or does not shrink the residual ends the polish.
double newtonPolished(CmLambdaTransform& f, double p, double lambda, double a, double b) {
  if (!(p > 0.0 && p < 1.0)) return p;
  double residual = f(p);
  for (int i = 0; i < 4 && residual != 0.0; ++i) {
    double next;
    if (p < 1e-280 && p >= DBL_MIN) {
      // Below 1e-280 the step in p is a denormal near DBL_MIN (read as zero
      // in the armed state, so p kept a 1e-308 search's error: densities
      // 3.5% off at scale 4e-306): the step is taken in ln p, with slope
      // p Q'(p) = p^lambda + p (1 - p)^(lambda - 1).
      // Checked exponentials: p^lambda may pass DBL_MAX (a large negative
      // lambda), and a step beyond 50 in ln p ends the polish.
      const double u = std::log(p);
      const double slope =
          mExponential(lambda * u, false) + p * mRaiseToPower(1.0 - p, lambda - 1.0, true);
      const double step = residual / slope;
      if (!(std::fabs(step) < 50.0)) break;
      next = std::exp(u - step);
    } else {
      const double slope =
          mRaiseToPower(p, lambda - 1.0, true) + mRaiseToPower(1.0 - p, lambda - 1.0, true);
      next = p - residual / slope;
    }
    if (!(next > a && next < b)) break;
    const double nextResidual = f(next);
    if (!(std::fabs(nextResidual) < std::fabs(residual))) break;
    p = next;
    residual = nextResidual;
  }
  return p;
}

// The lower tail at the standardised z for the cases other than the
// logistic limit; the missing value when the search has no answer.
double lambdaLowerTail(double z, double lambda) {
  if (lambda > 0.0) {
    if (z <= -1.0 / lambda) return 0.0;
    if (z >= 1.0 / lambda) return 1.0;
  }
  if (mEqualWithinFuzz(lambda, 1.0, 0.0)) return (z + 1.0) / 2.0;
  if (mEqualWithinFuzz(lambda, 2.0, 0.0)) return z + 0.5;
  double a = 0.0, b = 1.0;
  if (lambda < 0.0 && !negativeLambdaBracket(z, lambda, &a, &b)) return z <= 0.0 ? 0.0 : 1.0;
  CmLambdaTransform f(lambda, z);
  f.mAbsoluteToleranceForX = kQuantileSearchToleranceX;
  int status = 0;
  const double root = mRootFinder(a, b, f, &status);
  return mIsNumericMissing(root) ? root : newtonPolished(f, root, lambda, a, b);
}

}  // namespace

CmLambdaTransform::CmLambdaTransform(double lambda, double z) : mLambda(lambda), mZ(z) {}

double CmLambdaTransform::operator()(double p) {
  return lambdaTransform(p, mLambda) - mZ;
}

// At lambda < 0 the powers refuse p = 0 or p = 1 (zero to a negative power);
// that failure, like an overflow, gives the prepared missing value.
namespace {

// The density where the lower tail p at w = -|z| is below 1e-290, for lambda
// below 1: there (1 - p)^lambda = 1 to double precision, so p^lambda =
// 1 + lambda w and ln p = ln(1 + lambda w) / lambda, and p^(lambda - 1) is
// the whole of Q'(p): f = p^(1 - lambda) / scale, formed as one exponential.
// The plain form would meet p below DBL_MIN as a denormal, read as zero by
// the armed state, while a scale near DBL_MIN can make the density an
// ordinary number (it gave 3424.8 for 711.3). False where p is not that small.
bool tinyTailDensity(double w, double lambda, double scale, double* density) {
  if (!(lambda < 1.0)) return false;
  const double t = lambda > 0.0 || w > -1e10 ? lambda * w : 0.0;
  if (t <= -1.0) {
    *density = 0.0;  // the end of a bounded support
    return true;
  }
  // lambda w beyond 1e10 (lambda < 0): ln(lambda w) + ln(1 + 1/(lambda w)).
  const double logOnePlus = lambda < 0.0 && w <= -1e10
                                ? std::log(-lambda) + std::log(-w) + std::log1p(1.0 / lambda / w)
                                : std::log1p(t);
  const double logP = logOnePlus / lambda;
  if (!(logP < -667.0)) return false;
  const double logDensity = (1.0 - lambda) * logP - std::log(scale);
  if (logDensity > 709.0) return false;
  *density = logDensity < -745.0 ? 0.0 : std::exp(logDensity);
  return true;
}

}  // namespace

double mLambdaPdf(double x, double lambda, double location, double scale) {
  double result = mGetMissingValueCode();
  try {
    const double z = mStandardize(x, location, scale);
    if (isLogisticLimit(lambda)) return mLogisticPdf(x, location, scale);
    if (lambda > 0.0 && (z < -1.0 / lambda || z > 1.0 / lambda)) return 0.0;
    double tiny = 0.0;
    if (tinyTailDensity(-std::fabs(z), lambda, scale, &tiny)) return tiny;
    // The density is symmetric: search on the lower side, where p is small
    // and carries its full relative accuracy into p^(lambda - 1).
    const double p = lambdaLowerTail(-std::fabs(z), lambda);
    if (mIsNumericMissing(p)) return p;
    // Far out on a heavy tail (lambda < 0) p^(lambda - 1) exceeds the double
    // range and the density is below the smallest double.
    const double left = mRaiseToPower(p, lambda - 1.0, false);
    const double right = mRaiseToPower(1.0 - p, lambda - 1.0, false);
    if (left >= DBL_MAX / 4.0 || right >= DBL_MAX / 4.0) return 0.0;
    // One division by the product where the scale is below 1: 1 / (left +
    // right) alone may be a denormal (read as zero in the armed state); the
    // product itself must stay normal.
    const double sum = left + right;
    result = scale < 1.0 && sum * scale >= DBL_MIN ? 1.0 / (sum * scale) : 1.0 / sum / scale;
  } catch (const std::runtime_error&) {
  } catch (const std::invalid_argument&) {
  }
  return result;
}

double mLambdaCdf(double x, double lambda, double location, double scale, bool upperTail) {
  double result = mGetMissingValueCode();
  try {
    double z = mStandardize(x, location, scale);
    if (isLogisticLimit(lambda)) return mLogisticCdf(z, 0.0, 1.0, upperTail);
    if (upperTail) z = -z;
    result = lambdaLowerTail(z, lambda);
  } catch (const std::runtime_error&) {
  } catch (const std::invalid_argument&) {
  }
  return result;
}

double mLambdaInvCdf(double p, double lambda, double location, double scale) {
  double result = mGetMissingValueCode();
  try {
    double z;
    if (isLogisticLimit(lambda)) {
      z = mLogisticInvCdf(p, 0.0, 1.0);
    } else if (mEqualWithinFuzz(lambda, 1.0, 0.0)) {
      z = 2.0 * p - 1.0;
    } else if (mEqualWithinFuzz(lambda, 2.0, 0.0)) {
      z = p - 0.5;
    } else {
      z = lambdaTransform(p, lambda);
    }
    if (z >= mGetMissingValueCode()) return z;
    result = location + scale * z;
  } catch (const std::runtime_error&) {
  } catch (const std::invalid_argument&) {
  }
  return result;
}

}  // namespace qel
