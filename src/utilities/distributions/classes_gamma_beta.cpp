// Rejection generators of the gamma and beta families and the families built
// on them (chi-square, F, t).
//
//   gamma, shape < 1:   Ahrens and Dieter (1974), algorithm GS, Computing 12.
//   gamma, 1 < shape < 4: rejection from a uniform piece up to the mode and an
//                       exponential tail above it, tested with a unit
//                       exponential.
//   gamma, shape >= 4:  Ahrens and Dieter (1974), algorithm GO: a normal
//                       envelope about the mode with an exponential tail.
//   beta:               Cheng (1978), algorithms BB (both shapes above 1) and
//                       BC, Comm. ACM 21, 317-322.
#include <algorithm>
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/classes.h"
#include "utilities/distributions/kernels.h"
#include "utilities/higher_functions/incomplete_beta.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

// ---------------------------------------------------------------------------
// GS: with b = (e + a)/e, p = b u. p <= 1: x = p^(1/a), accepted with
// probability exp(-x); p > 1: x = -ln((b - p)/a), accepted with probability
// x^(a - 1).

CmDistGammaA::CmDistGammaA(double shape) : mShape(shape), mB((mGetE() + shape) / mGetE()) {}

double CmDistGammaA::mGetRandom() const {
  double x = 0.0;
  try {
    for (;;) {
      const double p = mB * mUniform();
      if (p <= 1.0) {
        x = mRaiseToPower(p, 1.0 / mShape, true);
        if (mUniform() <= mExponential(-x, true)) return x;
      } else {
        x = -mLog((mB - p) / mShape, true);
        if (mUniform() <= mRaiseToPower(x, mShape - 1.0, true)) return x;
      }
    }
  } catch (const std::runtime_error&) {
    mMsgCode = qelFailRandomVariate;
  }
  return x;
}

// ---------------------------------------------------------------------------
// Shape in (1, 4): with m = shape - 1 the density is proportional to
// x^m e^-x, largest at m. Below the mode the envelope is the constant h-scaled
// peak, above it an exponential of rate t through the tangent point; w is the
// share of the first piece. e is a unit exponential, v chooses the piece.

CmDistGammaB::CmDistGammaB(double shape) : mShape(shape) {
  mM = shape - 1.0;
  mT = (std::sqrt(4.0 * mM + 1.0) - 1.0) / (2.0 * mM);
  mQ = 1.0 - mT;
  mH = std::pow(mQ, mM);
  mC = mM * mH + mExponential(-mT * mM, true) / mT;
  mW = mM * mH / mC;
  mLn2 = std::log(2.0);
  mMLnM = mM * std::log(mM) - mM;
}

double CmDistGammaB::mGetRandom() const {
  double x = 0.0;
  try {
    for (;;) {
      const double e = -mLog(mUniform(), true);
      const double v = mUniform();
      if (v <= mW) {
        x = v * mC / mH;
        // Quick rejection: m ln 2 - x never exceeds the exact bound below.
        if (e < mM * mLn2 - x) continue;
        if (e >= mMLnM - mM * mLog(x, true) + x) return x;
      } else {
        x = -mLog((1.0 - v) * mT * mC, true) / mT;
        if (e >= mM * mLog(mM / (mQ * x), true) + mQ * x - mM) return x;
      }
    }
  } catch (const std::runtime_error&) {
    mMsgCode = qelFailRandomVariate;
  }
  return x;
}

// ---------------------------------------------------------------------------
// GO. The envelope is a normal of variance s2 about the mode mu on [0, b]
// (weight 1 - p) and the tangent exponential of rate d/b beyond b (weight p).
// The tail piece is scaled so that the two weights stand in the ratio
// p : 1 - p; its height at b is K = sqrt(2 pi) s (d/b) p/(1 - p), kept as a
// logarithm.

CmDistGammaC::CmDistGammaC(double shape) : mShape(shape), mNormal(new CmDistNormal(0.0, 1.0)) {
  mMu = shape - 1.0;
  mV = std::sqrt(shape);
  mS2 = shape + 1.632993161855452 * mV;
  mS = std::sqrt(mS2);
  mW = mS2 / mMu;
  mD = 2.449489742783178 * mS;
  mB = mMu + mD;
  mP = 0.009572265238289;
  mLogTail = std::log(std::sqrt(2.0 * mGetPi()) * mS * (mD / mB) * mP / (1.0 - mP));
}

CmDistGammaC::~CmDistGammaC() {
  delete mNormal;
}

void CmDistGammaC::SetBrng(CmUniformGenerator* brng) {
  CmDist::SetBrng(brng);
  mNormal->SetBrng(brng);
}

double CmDistGammaC::mGetRandom() const {
  double x = mMu;
  try {
    for (;;) {
      if (mUniform() >= mP) {
        // Central piece: accept with probability f(x)/f(mu) / exp(-z^2/2).
        const double z = mNormal->mGetRandom();
        x = mMu + mS * z;
        if (x <= 0.0 || x > mB) continue;
        const double half = 0.5 * z * z;
        const double u = mUniform();
        // Squeeze: ln u <= u - 1, so u - 1 below the bound accepts at once.
        // The bound is mu (1 + ln(x/mu)) - x + z^2/2.
        const double bound = mMu * (1.0 + mLog(x / mMu, true)) - x + half;
        if (u - 1.0 <= bound || mLog(u, true) <= bound) return x;
      } else {
        // Tail beyond b: exponential of rate d/b.
        x = mB * (1.0 - mLog(mUniform(), true) / mD);
        const double u = mUniform();
        const double bound =
            mMu * (1.0 + mLog(x / mMu, true)) - x + (mD / mB) * (x - mB) - mLogTail;
        if (mLog(u, true) <= bound) return x;
      }
    }
  } catch (const std::runtime_error&) {
    mMsgCode = qelFailRandomVariate;
  }
  return x;
}

// ---------------------------------------------------------------------------
// Gamma: the standard generator chosen by the shape, then scale and shift.

CmDistGamma::CmDistGamma(double shape, double scale, double threshold)
    : mShape(shape), mScale(scale), mThreshold(threshold), mInner(nullptr) {
  mInitialize();
}

CmDistGamma::~CmDistGamma() {
  delete mInner;
}

void CmDistGamma::mInitialize() {
  if (mEqualWithinFuzz(mShape, 1.0, 0.0))
    mInner = new CmDistExponential(1.0, 0.0);
  else if (mShape < 1.0)
    mInner = new CmDistGammaA(mShape);
  else if (mShape < 4.0)
    mInner = new CmDistGammaB(mShape);
  else
    mInner = new CmDistGammaC(mShape);
}

void CmDistGamma::SetBrng(CmUniformGenerator* brng) {
  CmDist::SetBrng(brng);
  mInner->SetBrng(brng);
}

double CmDistGamma::mPdf(double x) const {
  return mGammaPdf(x, mShape, mScale, mThreshold);
}
double CmDistGamma::mCdf(double x, bool upperTail) const {
  return mGammaCdf(x, mShape, mScale, mThreshold, upperTail);
}
double CmDistGamma::mInvCdf(double p) const {
  return mGammaInvCdf(p, mShape, mScale, mThreshold);
}

double CmDistGamma::mGetRandom() const {
  // The rejection loops are only sound for a positive shape.
  if (!(mShape > 0.0)) {
    mMsgCode = qelFailRandomVariate;
    return mGetMissingValueCode();
  }
  const double g = mInner->mGetRandom();
  if (mInner->GetMsgCode() != 0) mMsgCode = mInner->GetMsgCode();
  return mThreshold + mScale * g;
}

// ---------------------------------------------------------------------------
// Chi-square: a gamma of shape df/2 and scale 2; the noncentrality does not
// enter the draw.

CmDistChiSq::CmDistChiSq(double df, double noncentrality)
    : mDf(df), mNoncentrality(noncentrality), mGamma(new CmDistGamma(df / 2.0, 2.0, 0.0)) {}

CmDistChiSq::~CmDistChiSq() {
  delete mGamma;
}

void CmDistChiSq::SetBrng(CmUniformGenerator* brng) {
  CmDist::SetBrng(brng);
  mGamma->SetBrng(brng);
}

double CmDistChiSq::mPdf(double x) const {
  return mChiSqPdf(x, mDf);
}
double CmDistChiSq::mCdf(double x, bool upperTail) const {
  return mChiSqCdf(x, mDf, mNoncentrality, upperTail);
}
double CmDistChiSq::mInvCdf(double p) const {
  return mChiSqInvCdf(p, mDf, mNoncentrality);
}

double CmDistChiSq::mGetRandom() const {
  const double x = mGamma->mGetRandom();
  if (mGamma->GetMsgCode() != 0) mMsgCode = mGamma->GetMsgCode();
  return x;
}

// ---------------------------------------------------------------------------
// Beta. Cheng's algorithms draw w with w/(c + w) beta-distributed; which
// shape belongs to w depends on the algorithm, and the complement gives the
// shapes in the order asked for.

CmDistBeta::CmDistBeta(double a, double b) : mA(a), mB(b) {
  mSmall = std::min(a, b);
  mLarge = std::max(a, b);
  mFirstIsSmaller = mCompareWithFuzz(a, b, 0.0) < 0;
  mAlpha = mSmall + mLarge;
  mBeta = mGamma = mDelta = mK1 = mK2 = 0.0;
  if (!(mSmall > 0.0)) return;  // no draw: see mGetRandom
  if (mSmall > 1.0) {
    // BB: w/(large + w) ~ Beta(small, large).
    mBeta = std::sqrt((mAlpha - 2.0) / (2.0 * mSmall * mLarge - mAlpha));
    mGamma = mSmall + 1.0 / mBeta;
    mDelta = mK1 = mK2 = 0.0;
  } else {
    // BC: w/(small + w) ~ Beta(large, small).
    mBeta = 1.0 / mSmall;
    mDelta = 1.0 + mLarge - mSmall;
    mK1 = mDelta * (0.0138889 + 0.0416667 * mSmall) / (mLarge * mBeta - 0.777778);
    mK2 = 0.25 + (0.5 + 0.25 / mDelta) * mSmall;
    mGamma = 0.0;
  }
}

double CmDistBeta::mGetRandom() const {
  if (!mAreParamsValid()) {
    mMsgCode = qelFailRandomVariate;
    return mGetMissingValueCode();
  }
  return mSmall > 1.0 ? mDrawBB() : mDrawBC();
}

double CmDistBeta::mDrawBB() const {
  const double ln4 = 1.3862944;
  double w = 0.0;
  try {
    for (;;) {
      const double u1 = mUniform();
      const double u2 = mUniform();
      const double v = mBeta * mLog(u1 / (1.0 - u1), true);
      w = mSmall * mExponential(v, true);
      const double z = u1 * u1 * u2;
      const double r = mGamma * v - ln4;
      const double s = mSmall + r - w;
      if (s + 2.609438 >= 5.0 * z) break;  // 2.609438 = 1 + ln 5
      const double t = mLog(z, true);
      if (s > t) break;
      if (r + mAlpha * mLog(mAlpha / (mLarge + w), true) >= t) break;
    }
  } catch (const std::runtime_error&) {
    mMsgCode = qelFailRandomVariate;
  }
  const double x = w / (mLarge + w);
  // x has the smaller shape first.
  return mFirstIsSmaller ? x : 1.0 - x;
}

// BC with w = large e^v kept as its logarithm: for small shapes v reaches
// hundreds, where w itself overflows although w/(small + w) and its
// complement are plain numbers; both are formed directly, so that a draw near
// 0 keeps its relative accuracy.
double CmDistBeta::mDrawBC() const {
  const double ln4 = 1.3862944;
  const double lnSmall = std::log(mSmall), lnLarge = std::log(mLarge);
  double lnW = lnLarge, lnSum = std::log(mSmall + mLarge);
  try {
    for (;;) {
      const double u1 = mUniform();
      const double u2 = mUniform();
      double z;
      if (u1 < 0.5) {
        const double y = u1 * u2;
        z = u1 * y;
        if (0.25 * u2 + z - y >= mK1) continue;
      } else {
        z = u1 * u1 * u2;
        if (z >= mK2 && z > 0.25) continue;
      }
      const double v = mBeta * mLog(u1 / (1.0 - u1), true);
      lnW = lnLarge + v;
      // ln(small + w) without forming w.
      lnSum = lnW > lnSmall ? lnW + std::log1p(std::exp(lnSmall - lnW))
                            : lnSmall + std::log1p(std::exp(lnW - lnSmall));
      if (u1 >= 0.5 && z <= 0.25) break;
      if (mAlpha * (std::log(mAlpha) - lnSum + v) - ln4 >= mLog(z, true)) break;
    }
  } catch (const std::runtime_error&) {
    mMsgCode = qelFailRandomVariate;
  }
  // w/(small + w) has the larger shape first, small/(small + w) the smaller.
  return std::exp(mFirstIsSmaller ? lnSmall - lnSum : lnW - lnSum);
}

}  // namespace qel
