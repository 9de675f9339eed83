// Density, tails and draws of the beta, F and t objects.
//
// The tails are the incomplete beta ratio (ACM TOMS 708): the F lower tail at
// x is I_y(df1/2, df2/2) with y = df1 x/(df1 x + df2), and the central t tail
// beyond |t| is I_y(df/2, 1/2)/2 with y = df/(df + t^2). Each tail is computed
// in its own right from the complement argument, never as 1 minus the other.
// The quantiles and the noncentral t tails belong to the high-accuracy beta
// and t routines, which these objects do not reach yet: they answer the
// missing value.
#include <cmath>
#include <stdexcept>

#include "utilities/DistributionClasses.h"
#include "utilities/IncompleteBeta.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/SpecialFunctions.h"

namespace qel {
namespace {

// Beta density, with the end rules of the family: at 0 a shape below 1 has no
// finite value, a shape of 1 gives the other shape, larger shapes give 0.
double betaDensity(double x, double a, double b) {
  if (x < 0.0 || x > 1.0) return 0.0;
  if (x == 0.0) return a < 1.0 ? mGetMissingValueCode() : (a == 1.0 ? b : 0.0);
  if (x == 1.0) return b < 1.0 ? mGetMissingValueCode() : (b == 1.0 ? a : 0.0);
  try {
    return mExponential((a - 1.0) * std::log(x) + (b - 1.0) * std::log1p(-x) + mLogGamma(a + b) -
                            mLogGamma(a) - mLogGamma(b),
                        true);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

// I_x(a, b) (or its complement) with y = 1 - x given separately.
double betaTail(double x, double y, double a, double b, bool upperTail) {
  return mIncompleteBetaRatio(x, y, a, b, upperTail);
}

}  // namespace

double CmDistBeta::mPdf(double x) const {
  return betaDensity(x, mA, mB);
}

double CmDistBeta::mCdf(double x, bool upperTail) const {
  if (x <= 0.0) return upperTail ? 1.0 : 0.0;
  if (x >= 1.0) return upperTail ? 0.0 : 1.0;
  return betaTail(x, 1.0 - x, mA, mB, upperTail);
}

double CmDistBeta::mInvCdf(double) const {
  return mGetMissingValueCode();
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
  if (x <= 0.0) return 0.0;
  const double a = mDf1 / 2.0, b = mDf2 / 2.0, c = a + b;
  try {
    return mExponential(mLogGamma(c) - mLogGamma(a) - mLogGamma(b) + a * std::log(mDf1 / mDf2) +
                            (a - 1.0) * std::log(x) - c * std::log1p(x * mDf1 / mDf2),
                        true);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  }
}

double CmDistF::mCdf(double x, bool upperTail) const {
  if (mIsNumericMissing(x)) return x;
  if (x <= 0.0) return upperTail ? 1.0 : 0.0;
  if (mNoncentrality >= 2.2250738585072014e-307) return mGetMissingValueCode();
  const double t = mDf1 * x;
  return betaTail(t / (t + mDf2), mDf2 / (t + mDf2), mDf1 / 2.0, mDf2 / 2.0, upperTail);
}

double CmDistF::mInvCdf(double) const {
  return mGetMissingValueCode();
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
  if (mNoncentrality != 0.0 && x != 0.0) return mGetMissingValueCode();
  const double a = (mDf + 1.0) / 2.0, b = mDf / 2.0;
  try {
    return mExponential(mLogGamma(a) - mLogGamma(b) - 0.5 * std::log(mGetPi() * mDf) -
                            a * std::log1p(x * x / mDf) - mNoncentrality * mNoncentrality / 2.0,
                        true);
  } catch (const std::runtime_error&) {
    return 0.0;
  }
}

double CmDistT::mCdf(double x, bool upperTail) const {
  if (mIsNumericMissing(x) || mNoncentrality != 0.0) return mGetMissingValueCode();
  if (x == 0.0) return 0.5;
  const double t2 = x * x;
  // The tail beyond |x|, and the rest.
  const double far = 0.5 * betaTail(mDf / (mDf + t2), t2 / (mDf + t2), mDf / 2.0, 0.5, false);
  const double nearSide =
      0.5 + 0.5 * betaTail(mDf / (mDf + t2), t2 / (mDf + t2), mDf / 2.0, 0.5, true);
  const bool farIsAsked = (x < 0.0) != upperTail;
  return farIsAsked ? far : nearSide;
}

double CmDistT::mInvCdf(double) const {
  return mGetMissingValueCode();
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
