// Tukey's lambda distribution.
//
// The family is defined by its quantile function
//   Q(p) = (p^lambda - (1 - p)^lambda) / lambda,
// with the logistic distribution as the limit lambda -> 0, the uniform on
// [-1, 1] at lambda = 1 and the uniform on [-1/2, 1/2] at lambda = 2. The
// distribution function has no closed form in general: it is the root in p
// of Q(p) = z, and the density is 1/Q'(p) at that root. For lambda > 0 the
// support is [-1/lambda, 1/lambda]. The distribution is symmetric, so the
// upper tail at z is the lower tail at -z, computed in its own right.
#include <cmath>
#include <stdexcept>

#include "utilities/distributions/kernels.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/CheckedFunctions.h"

namespace qel {

namespace {

bool isLogisticLimit(double lambda) {
  return std::fabs(lambda) <= mGetEps(false);
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
  CmLambdaTransform f(lambda, z);
  int status = 0;
  return mRootFinder(0.0, 1.0, f, &status);
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
    const double z = (x - location) / scale;
    if (isLogisticLimit(lambda)) return mLogisticPdf(z, 0.0, 1.0);
    if (lambda > 0.0 && (z < -1.0 / lambda || z > 1.0 / lambda)) return 0.0;
    // The density is symmetric: search on the lower side, where p is small
    // and carries its full relative accuracy into p^(lambda - 1).
    const double p = lambdaLowerTail(-std::fabs(z), lambda);
    if (mIsNumericMissing(p)) return p;
    result = 1.0 / (scale * (mRaiseToPower(p, lambda - 1.0, true) +
                             mRaiseToPower(1.0 - p, lambda - 1.0, true)));
  } catch (const std::runtime_error&) {
  } catch (const std::invalid_argument&) {
  }
  return result;
}

double mLambdaCdf(double x, double lambda, double location, double scale, bool upperTail) {
  double result = mGetMissingValueCode();
  try {
    double z = (x - location) / scale;
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
