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
    const double slope =
        mRaiseToPower(p, lambda - 1.0, true) + mRaiseToPower(1.0 - p, lambda - 1.0, true);
    const double next = p - residual / slope;
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
  return (mRaiseToPower(p, mLambda, true) - mRaiseToPower(1.0 - p, mLambda, true)) / mLambda - mZ;
}

// At lambda < 0 the powers refuse p = 0 or p = 1 (zero to a negative power);
// that failure, like an overflow, gives the prepared missing value.
double mLambdaPdf(double x, double lambda, double location, double scale) {
  double result = mGetMissingValueCode();
  try {
    const double z = mStandardize(x, location, scale);
    if (isLogisticLimit(lambda)) return mLogisticPdf(z, 0.0, 1.0) / scale;
    if (lambda > 0.0 && (z < -1.0 / lambda || z > 1.0 / lambda)) return 0.0;
    // The density is symmetric: search on the lower side, where p is small
    // and carries its full relative accuracy into p^(lambda - 1).
    const double p = lambdaLowerTail(-std::fabs(z), lambda);
    if (mIsNumericMissing(p)) return p;
    // Far out on a heavy tail (lambda < 0) p^(lambda - 1) exceeds the double
    // range and the density is below the smallest double.
    const double left = mRaiseToPower(p, lambda - 1.0, false);
    const double right = mRaiseToPower(1.0 - p, lambda - 1.0, false);
    if (left >= DBL_MAX / 4.0 || right >= DBL_MAX / 4.0) return 0.0;
    result = 1.0 / (left + right) / scale;
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
      z = (mRaiseToPower(p, lambda, true) - mRaiseToPower(1.0 - p, lambda, true)) / lambda;
    }
    if (z >= mGetMissingValueCode()) return z;
    result = location + scale * z;
  } catch (const std::runtime_error&) {
  } catch (const std::invalid_argument&) {
  }
  return result;
}

}  // namespace qel
