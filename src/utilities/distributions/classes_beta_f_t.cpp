// Beta, F and t objects: density, tails and quantile from the kernels, and
// the draws of F and t built on the beta generator.
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/classes.h"
#include "utilities/distributions/kernels.h"

namespace qel {

double CmDistBeta::mPdf(double x) const {
  return mBetaPdf(x, mA, mB);
}

double CmDistBeta::mCdf(double x, bool upperTail) const {
  return mBetaCdf(x, mA, mB, upperTail);
}

double CmDistBeta::mInvCdf(double p) const {
  return mBetaInvCdf(p, mA, mB);
}

// ---------------------------------------------------------------------------
// F: df2/df1 times the odds of a Beta(df1/2, df2/2) draw, the draw held below
// 1 - eps so that the odds stay finite. The noncentrality does not enter.

CmDistF::CmDistF(double df1, double df2, double noncentrality)
    : mDf1(df1),
      mDf2(df2),
      mNoncentrality(noncentrality),
      mBeta(new CmDistBeta(df1 / 2, df2 / 2)) {}

CmDistF::~CmDistF() {
  delete mBeta;
}

void CmDistF::SetBrng(CmUniformGenerator* brng) {
  CmDist::SetBrng(brng);
  mBeta->SetBrng(brng);
}

double CmDistF::mPdf(double x) const {
  return mFPdf(x, mDf1, mDf2);
}

double CmDistF::mCdf(double x, bool upperTail) const {
  return mFCdf(x, mDf1, mDf2, mNoncentrality, upperTail);
}

double CmDistF::mInvCdf(double p) const {
  return mFInvCdf(p, mDf1, mDf2, mNoncentrality);
}

double CmDistF::mGetRandom() const {
  if (!(mDf1 > 0.0 && mDf2 > 0.0)) {
    mMsgCode = qelFailRandomVariate;
    return mGetMissingValueCode();
  }
  const double y = std::min(mBeta->mGetRandom(), 1.0 - mGetEps(false));
  if (mBeta->GetMsgCode() != 0) mMsgCode = mBeta->GetMsgCode();
  return (mDf2 / mDf1) * y / (1.0 - y);
}

// ---------------------------------------------------------------------------
// t: the signed square root of an F(1, df) draw, the sign from one more
// uniform; with a noncentrality, inversion.

CmDistT::CmDistT(double df, double noncentrality)
    : mDf(df), mNoncentrality(noncentrality), mF(new CmDistF(1.0, df, 0.0)) {}

CmDistT::~CmDistT() {
  delete mF;
}

void CmDistT::SetBrng(CmUniformGenerator* brng) {
  CmDist::SetBrng(brng);
  mF->SetBrng(brng);
}

double CmDistT::mPdf(double x) const {
  return mTPdf(x, mDf, mNoncentrality);
}

double CmDistT::mCdf(double x, bool upperTail) const {
  return mTCdf(x, mDf, mNoncentrality, upperTail);
}

double CmDistT::mInvCdf(double p) const {
  return mTInvCdf(p, mDf, mNoncentrality);
}

double CmDistT::mGetRandom() const {
  if (mNoncentrality != 0.0) return mInvCdf(mUniform());
  const double f = mF->mGetRandom();
  if (mF->GetMsgCode() != 0) {
    mMsgCode = mF->GetMsgCode();
    if (mIsNumericMissing(f)) return f;
  }
  const double t = std::sqrt(f);
  return mUniform() < 0.5 ? -t : t;
}

}  // namespace qel
