// Distribution objects of the continuous families drawn by inversion or by
// Marsaglia's polar method (Marsaglia and Bray 1964), and the shared base.
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/classes.h"
#include "utilities/distributions/kernels.h"

namespace qel {

void CmDist::mGetSupport(double, double, std::vector<double>&) const {}

bool CmDist::mIncludeLowerBoundInGraph() const {
  const double q1 = mInvCdf(0.01);
  const double q99 = mInvCdf(0.99);
  return !(0.2 * (q99 - q1) < q1 - mGetLowerBound());
}

// ---------------------------------------------------------------------------
// Inversion families: one uniform per draw through the kernel's quantile.

double CmDistCauchy::mPdf(double x) const {
  return mCauchyPdf(x, mLocation, mScale);
}
double CmDistCauchy::mCdf(double x, bool upperTail) const {
  return mCauchyCdf(x, mLocation, mScale, upperTail);
}
double CmDistCauchy::mInvCdf(double p) const {
  return mCauchyInvCdf(p, mLocation, mScale);
}
double CmDistCauchy::mGetRandom() const {
  return mCauchyInvCdf(mUniform(), mLocation, mScale);
}

double CmDistExponential::mPdf(double x) const {
  return mExponentialPdf(x, mScale, mThreshold);
}
double CmDistExponential::mCdf(double x, bool upperTail) const {
  return mExponentialCdf(x, mScale, mThreshold, upperTail);
}
double CmDistExponential::mInvCdf(double p) const {
  return mExponentialInvCdf(p, mScale, mThreshold);
}
double CmDistExponential::mGetRandom() const {
  return mExponentialInvCdf(mUniform(), mScale, mThreshold);
}

double CmDistLaplace::mPdf(double x) const {
  return mLaplacePdf(x, mLocation, mScale);
}
double CmDistLaplace::mCdf(double x, bool upperTail) const {
  return mLaplaceCdf(x, mLocation, mScale, upperTail);
}
double CmDistLaplace::mInvCdf(double p) const {
  return mLaplaceInvCdf(p, mLocation, mScale);
}
double CmDistLaplace::mGetRandom() const {
  return mLaplaceInvCdf(mUniform(), mLocation, mScale);
}

double CmDistLargestExtremeValue::mPdf(double x) const {
  return mLargestExtremeValuePdf(x, mLocation, mScale);
}
double CmDistLargestExtremeValue::mCdf(double x, bool upperTail) const {
  return mLargestExtremeValueCdf(x, mLocation, mScale, upperTail);
}
double CmDistLargestExtremeValue::mInvCdf(double p) const {
  return mLargestExtremeValueInvCdf(p, mLocation, mScale);
}
double CmDistLargestExtremeValue::mGetRandom() const {
  return mLargestExtremeValueInvCdf(mUniform(), mLocation, mScale);
}

double CmDistSmallestExtremeValue::mPdf(double x) const {
  return mSmallestExtremeValuePdf(x, mLocation, mScale);
}
double CmDistSmallestExtremeValue::mCdf(double x, bool upperTail) const {
  return mSmallestExtremeValueCdf(x, mLocation, mScale, upperTail);
}
double CmDistSmallestExtremeValue::mInvCdf(double p) const {
  return mSmallestExtremeValueInvCdf(p, mLocation, mScale);
}
// The mirror image of the largest extreme value: -X with X drawn at 1 - u.
double CmDistSmallestExtremeValue::mGetRandom() const {
  const double x = mLargestExtremeValueInvCdf(1.0 - mUniform(), -mLocation, mScale);
  return mIsNumericMissing(x) ? x : -x;
}

double CmDistLogistic::mPdf(double x) const {
  return mLogisticPdf(x, mLocation, mScale);
}
double CmDistLogistic::mCdf(double x, bool upperTail) const {
  return mLogisticCdf(x, mLocation, mScale, upperTail);
}
double CmDistLogistic::mInvCdf(double p) const {
  return mLogisticInvCdf(p, mLocation, mScale);
}
double CmDistLogistic::mGetRandom() const {
  return mLogisticInvCdf(mUniform(), mLocation, mScale);
}

double CmDistLambda::mPdf(double x) const {
  return mLambdaPdf(x, mLambda, mLocation, mScale);
}
double CmDistLambda::mCdf(double x, bool upperTail) const {
  return mLambdaCdf(x, mLambda, mLocation, mScale, upperTail);
}
double CmDistLambda::mInvCdf(double p) const {
  return mLambdaInvCdf(p, mLambda, mLocation, mScale);
}
double CmDistLambda::mGetRandom() const {
  return mLambdaInvCdf(mUniform(), mLambda, mLocation, mScale);
}

double CmDistLogLogistic::mPdf(double x) const {
  return mLogLogisticPdf(x, mLocation, mScale, mThreshold);
}
double CmDistLogLogistic::mCdf(double x, bool upperTail) const {
  return mLogLogisticCdf(x, mLocation, mScale, mThreshold, upperTail);
}
double CmDistLogLogistic::mInvCdf(double p) const {
  return mLogLogisticInvCdf(p, mLocation, mScale, mThreshold);
}
double CmDistLogLogistic::mGetRandom() const {
  return mLogLogisticInvCdf(mUniform(), mLocation, mScale, mThreshold);
}

double CmDistWeibull::mPdf(double x) const {
  return mWeibullPdf(x, mShape, mScale, mThreshold);
}
double CmDistWeibull::mCdf(double x, bool upperTail) const {
  return mWeibullCdf(x, mShape, mScale, mThreshold, upperTail);
}
double CmDistWeibull::mInvCdf(double p) const {
  return mWeibullInvCdf(p, mShape, mScale, mThreshold);
}
double CmDistWeibull::mGetRandom() const {
  return mWeibullInvCdf(mUniform(), mShape, mScale, mThreshold);
}

double CmDistTriangular::mPdf(double x) const {
  return mTriangularPdf(x, mLower, mMode, mUpper);
}
double CmDistTriangular::mCdf(double x, bool upperTail) const {
  return mTriangularCdf(x, mLower, mMode, mUpper, upperTail);
}
double CmDistTriangular::mInvCdf(double p) const {
  return mTriangularInvCdf(p, mLower, mMode, mUpper);
}
double CmDistTriangular::mGetRandom() const {
  return mTriangularInvCdf(mUniform(), mLower, mMode, mUpper);
}

double CmDistUniform::mPdf(double x) const {
  return mUniformPdf(x, mLower, mUpper);
}
double CmDistUniform::mCdf(double x, bool upperTail) const {
  return mUniformCdf(x, mLower, mUpper, upperTail);
}
double CmDistUniform::mInvCdf(double p) const {
  return mUniformInvCdf(p, mLower, mUpper);
}
double CmDistUniform::mGetRandom() const {
  return mLower + mUniform() * (mUpper - mLower);
}

// ---------------------------------------------------------------------------
// Normal: the polar method. Each accepted pair (v1, v2) in the unit disc gives
// two independent normals v1 r and v2 r, r = sqrt(-2 ln s / s); the second is
// kept for the next call.

double CmDistNormal::mPdf(double x) const {
  return mNormalPdf(x, mMean, mSigma);
}
double CmDistNormal::mCdf(double x, bool upperTail) const {
  return mNormalCdf(x, mMean, mSigma, upperTail);
}
double CmDistNormal::mInvCdf(double p) const {
  return mNormalInvCdf(p, mMean, mSigma);
}

double CmDistNormal::mGetRandom() const {
  if (mHaveStored) {
    mHaveStored = false;
    return mMean + mSigma * mStored;
  }
  double v1, v2, s;
  do {
    v1 = 2.0 * mUniform() - 1.0;
    v2 = 2.0 * mUniform() - 1.0;
    s = v1 * v1 + v2 * v2;
    // s = 0 would make the logarithm fail; it is rejected with the pairs
    // outside the disc (probability about 2^-60 per pair).
  } while (s > 1.0 || s == 0.0);
  const double r = std::sqrt(-2.0 * mLog(s, true) / s);
  mStored = v1 * r;
  mHaveStored = true;
  return mMean + mSigma * (v2 * r);
}

CmDistLogNormal::CmDistLogNormal(double location, double scale, double threshold)
    : mLocation(location),
      mScale(scale),
      mThreshold(threshold),
      mNormal(new CmDistNormal(location, scale)) {}

CmDistLogNormal::~CmDistLogNormal() {
  delete mNormal;
}

void CmDistLogNormal::SetBrng(CmUniformGenerator* brng) {
  CmDist::SetBrng(brng);
  mNormal->SetBrng(brng);
}

double CmDistLogNormal::mPdf(double x) const {
  return mLogNormalPdf(x, mLocation, mScale, mThreshold);
}
double CmDistLogNormal::mCdf(double x, bool upperTail) const {
  return mLogNormalCdf(x, mLocation, mScale, mThreshold, upperTail);
}
double CmDistLogNormal::mInvCdf(double p) const {
  return mLogNormalInvCdf(p, mLocation, mScale, mThreshold);
}

double CmDistLogNormal::mGetRandom() const {
  const double z = mNormal->mGetRandom();
  try {
    return mExponential(z, true) + mThreshold;
  } catch (const std::runtime_error&) {
    // exp of a draw beyond the double range: no value for this element.
    mMsgCode = qelFailRandomVariate;
    return mGetMissingValueCode();
  }
}

}  // namespace qel
