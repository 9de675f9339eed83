// Distribution objects: a family with its parameters held, a validity test,
// bounds and support for graphs, density, tails and quantile forwarded to the
// kernels of kernels.h, and random variates drawn from a borrowed
// CmUniformGenerator.
//
// The variate algorithm of each family is fixed (it decides which stream of
// numbers a seed gives): inversion where a closed quantile exists, Marsaglia's
// polar method for the normal, Ahrens and Dieter's GS and GO and a two-piece
// exponential rejection for the gamma, Cheng's BB and BC for the beta,
// sequential sampling for the hypergeometric, counted Bernoulli trials for the
// binomial, the gamma-Poisson mixture for the negative binomial and Walker's
// alias method for finite tables.
//
// Constructors do not refuse bad parameters; mAreParamsValid() says whether
// they are usable. A draw that fails does not throw: it stores a message code,
// read with GetMsgCode() after the loop. An object and its generator belong to
// one thread at a time (draws change mutable state even through const).
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONCLASSES_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONCLASSES_H

#include <map>
#include <vector>

#include "interfaces/math/rngs.h"
#include "utilities/MatrixLibrary/legacy_matrix.h"

namespace qel {

class CmDist {
 public:
  CmDist() : mBrng(nullptr), mMsgCode(0) {}
  CmDist(const CmDist&) = delete;
  CmDist& operator=(const CmDist&) = delete;
  virtual ~CmDist() {}

  virtual void SetBrng(CmUniformGenerator* brng) { mBrng = brng; }
  virtual bool mAreParamsValid() const { return true; }
  virtual double mPdf(double x) const = 0;
  virtual double mCdf(double x, bool upperTail) const = 0;
  virtual double mInvCdf(double p) const = 0;
  virtual double mGetRandom() const = 0;
  virtual bool mIsContinuous() const { return true; }
  // Discrete families: the integers of the support in [from, to], ascending.
  virtual void mGetSupport(double from, double to, std::vector<double>& out) const;
  virtual void mGetDRefPoints(std::vector<double>& out) const { out.clear(); }
  virtual bool mHasLowerBound() const { return false; }
  virtual bool mHasUpperBound() const { return false; }
  virtual double mGetLowerBound() const { return 0.0; }
  virtual double mGetUpperBound() const { return 0.0; }
  virtual void mGetParameters(std::vector<double>& out) const { out.clear(); }
  // The parameters without a noncentrality.
  virtual void mGetNonInvCDFParameters(std::vector<double>& out) const { mGetParameters(out); }
  // One random vector (multivariate families).
  virtual void mGetRandom(std::vector<double>& out) = 0;

  int GetMsgCode() const { return mMsgCode; }
  // True when the lower bound lies near the body: unless
  // 0.2 (q99 - q1) < q1 - lowerBound, q1 and q99 being the 1% and 99% points.
  bool mIncludeLowerBoundInGraph() const;

 protected:
  double mUniform() const { return mBrng->mGetRandom(); }

  CmUniformGenerator* mBrng;
  mutable int mMsgCode;
};

// Shared pieces of the scalar families: no vector draw.
class CmDistScalar : public CmDist {
 public:
  using CmDist::mGetRandom;
  void mGetRandom(std::vector<double>& out) override { out.clear(); }
};

class CmDistBernoulli : public CmDistScalar {
 public:
  explicit CmDistBernoulli(double p) : mP(p) {}
  bool mAreParamsValid() const override;
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mIsContinuous() const override { return false; }
  void mGetSupport(double from, double to, std::vector<double>& out) const override;
  bool mHasLowerBound() const override { return true; }
  bool mHasUpperBound() const override { return true; }
  double mGetUpperBound() const override { return 1.0; }
  void mGetParameters(std::vector<double>& out) const override { out = {mP}; }

 private:
  double mP;
};

class CmDistBeta : public CmDistScalar {
 public:
  CmDistBeta(double a, double b);
  bool mAreParamsValid() const override { return mA > 0.0 && mB > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  void mGetDRefPoints(std::vector<double>& out) const override { out = {0.0, 1.0}; }
  bool mHasLowerBound() const override { return true; }
  bool mHasUpperBound() const override { return true; }
  double mGetUpperBound() const override { return 1.0; }
  void mGetParameters(std::vector<double>& out) const override { out = {mA, mB}; }

 private:
  double mDrawBB() const;
  double mDrawBC() const;

  double mA;
  double mB;
  // Cheng's constants: shapes ordered for the algorithm in use.
  double mSmall, mLarge, mAlpha, mBeta, mGamma, mDelta, mK1, mK2;
  bool mFirstIsSmaller;
};

class CmDistBinomial : public CmDistScalar {
 public:
  CmDistBinomial(int n, double p) : mN(n), mP(p) {}
  bool mAreParamsValid() const override { return mP >= 0.0 && mP <= 1.0 && mN > 0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mIsContinuous() const override { return false; }
  void mGetSupport(double from, double to, std::vector<double>& out) const override;
  bool mHasLowerBound() const override { return true; }
  bool mHasUpperBound() const override { return true; }
  double mGetUpperBound() const override { return mN; }
  void mGetParameters(std::vector<double>& out) const override { out = {double(mN), mP}; }

 private:
  int mN;
  double mP;
};

class CmDistCauchy : public CmDistScalar {
 public:
  CmDistCauchy(double location, double scale) : mLocation(location), mScale(scale) {}
  bool mAreParamsValid() const override { return mScale > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  void mGetDRefPoints(std::vector<double>& out) const override { out = {mLocation}; }
  void mGetParameters(std::vector<double>& out) const override { out = {mLocation, mScale}; }

 private:
  double mLocation;
  double mScale;
};

class CmDistExponential : public CmDistScalar {
 public:
  CmDistExponential(double scale, double threshold) : mScale(scale), mThreshold(threshold) {}
  bool mAreParamsValid() const override { return mScale > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mHasLowerBound() const override { return mIncludeLowerBoundInGraph(); }
  double mGetLowerBound() const override { return mThreshold; }
  void mGetParameters(std::vector<double>& out) const override { out = {mScale, mThreshold}; }

 private:
  double mScale;
  double mThreshold;
};

// Ahrens and Dieter's GS, shape below 1 (the standard gamma, scale 1).
class CmDistGammaA : public CmDistScalar {
 public:
  explicit CmDistGammaA(double shape);
  double mPdf(double) const override { return 0.0; }
  double mCdf(double, bool) const override { return 0.0; }
  double mInvCdf(double) const override { return 0.0; }
  double mGetRandom() const override;

 private:
  double mShape;
  double mB;
};

// Exponential-envelope rejection about the mode, shape in (1, 4).
class CmDistGammaB : public CmDistScalar {
 public:
  explicit CmDistGammaB(double shape);
  double mPdf(double) const override { return 0.0; }
  double mCdf(double, bool) const override { return 0.0; }
  double mInvCdf(double) const override { return 0.0; }
  double mGetRandom() const override;

 private:
  double mShape;
  double mM, mT, mQ, mH, mC, mW, mLn2, mMLnM;
};

class CmDistNormal;

// Ahrens and Dieter's GO, shape 4 and above.
class CmDistGammaC : public CmDistScalar {
 public:
  explicit CmDistGammaC(double shape);
  ~CmDistGammaC() override;
  void SetBrng(CmUniformGenerator* brng) override;
  double mPdf(double) const override { return 0.0; }
  double mCdf(double, bool) const override { return 0.0; }
  double mInvCdf(double) const override { return 0.0; }
  double mGetRandom() const override;

 private:
  double mShape;
  double mMu, mV, mS2, mS, mW, mD, mB, mP, mLogTail;
  CmDistNormal* mNormal;
};

class CmDistGamma : public CmDistScalar {
 public:
  CmDistGamma(double shape, double scale, double threshold);
  ~CmDistGamma() override;
  void SetBrng(CmUniformGenerator* brng) override;
  bool mAreParamsValid() const override { return mShape > 0.0 && mScale > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mHasLowerBound() const override { return mIncludeLowerBoundInGraph(); }
  double mGetLowerBound() const override { return mThreshold; }
  void mGetParameters(std::vector<double>& out) const override {
    out = {mShape, mScale, mThreshold};
  }
  // The standard generator chosen for the shape (for tests of the dispatch).
  const CmDist* mGetInner() const { return mInner; }

 private:
  void mInitialize();

  double mShape;
  double mScale;
  double mThreshold;
  CmDist* mInner;
};

class CmDistChiSq : public CmDistScalar {
 public:
  CmDistChiSq(double df, double noncentrality);
  ~CmDistChiSq() override;
  void SetBrng(CmUniformGenerator* brng) override;
  bool mAreParamsValid() const override { return mDf > 0.0 && mNoncentrality >= 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mHasLowerBound() const override { return mIncludeLowerBoundInGraph(); }
  void mGetParameters(std::vector<double>& out) const override { out = {mDf, mNoncentrality}; }
  void mGetNonInvCDFParameters(std::vector<double>& out) const override { out = {mDf}; }

 private:
  double mDf;
  double mNoncentrality;
  CmDistGamma* mGamma;
};

class CmDistF : public CmDistScalar {
 public:
  CmDistF(double df1, double df2, double noncentrality);
  ~CmDistF() override;
  void SetBrng(CmUniformGenerator* brng) override;
  bool mAreParamsValid() const override {
    return mDf1 > 0.0 && mDf2 > 0.0 && mNoncentrality >= 0.0;
  }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mHasLowerBound() const override { return mIncludeLowerBoundInGraph(); }
  void mGetParameters(std::vector<double>& out) const override {
    out = {mDf1, mDf2, mNoncentrality};
  }
  void mGetNonInvCDFParameters(std::vector<double>& out) const override { out = {mDf1, mDf2}; }

 private:
  double mDf1;
  double mDf2;
  double mNoncentrality;
  CmDistBeta* mBeta;
};

class CmDistHypergeometric : public CmDistScalar {
 public:
  CmDistHypergeometric(int N, int M, int n) : mN(N), mM(M), mSample(n) {}
  bool mAreParamsValid() const override {
    return mN >= 1 && mM >= 0 && mM <= mN && mSample >= 0 && mSample <= mN;
  }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mIsContinuous() const override { return false; }
  void mGetSupport(double from, double to, std::vector<double>& out) const override;
  bool mHasLowerBound() const override { return true; }
  bool mHasUpperBound() const override { return true; }
  double mGetLowerBound() const override;
  double mGetUpperBound() const override;
  void mGetParameters(std::vector<double>& out) const override {
    out = {double(mN), double(mM), double(mSample)};
  }

 private:
  int mN;
  int mM;
  int mSample;
};

class CmDistIntegerUniform : public CmDistScalar {
 public:
  CmDistIntegerUniform(int a, int b) : mA(a), mB(b) {}
  bool mAreParamsValid() const override { return mA <= mB; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mIsContinuous() const override { return false; }
  void mGetSupport(double from, double to, std::vector<double>& out) const override;
  bool mHasLowerBound() const override { return true; }
  bool mHasUpperBound() const override { return true; }
  double mGetLowerBound() const override { return mA; }
  double mGetUpperBound() const override { return mB; }
  void mGetParameters(std::vector<double>& out) const override { out = {double(mA), double(mB)}; }

 private:
  int mA;
  int mB;
};

// The location-scale families drawn by inversion of their closed quantile.
#define QEL_LOCATION_SCALE_CLASS(Name)                                                          \
  class Name : public CmDistScalar {                                                            \
   public:                                                                                      \
    Name(double location, double scale) : mLocation(location), mScale(scale) {}                 \
    bool mAreParamsValid() const override { return mScale > 0.0; }                              \
    double mPdf(double x) const override;                                                       \
    double mCdf(double x, bool upperTail) const override;                                       \
    double mInvCdf(double p) const override;                                                    \
    double mGetRandom() const override;                                                         \
    void mGetDRefPoints(std::vector<double>& out) const override { out = {mLocation}; }         \
    void mGetParameters(std::vector<double>& out) const override { out = {mLocation, mScale}; } \
                                                                                                \
   private:                                                                                     \
    double mLocation;                                                                           \
    double mScale;                                                                              \
  };

QEL_LOCATION_SCALE_CLASS(CmDistLaplace)
QEL_LOCATION_SCALE_CLASS(CmDistLargestExtremeValue)
QEL_LOCATION_SCALE_CLASS(CmDistLogistic)
QEL_LOCATION_SCALE_CLASS(CmDistSmallestExtremeValue)
#undef QEL_LOCATION_SCALE_CLASS

class CmDistLambda : public CmDistScalar {
 public:
  CmDistLambda(double lambda, double location, double scale)
      : mLambda(lambda), mLocation(location), mScale(scale) {}
  bool mAreParamsValid() const override { return mScale > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  void mGetDRefPoints(std::vector<double>& out) const override { out = {mLocation}; }
  void mGetParameters(std::vector<double>& out) const override {
    out = {mLambda, mLocation, mScale};
  }

 private:
  double mLambda;
  double mLocation;
  double mScale;
};

class CmDistLogLogistic : public CmDistScalar {
 public:
  CmDistLogLogistic(double location, double scale, double threshold)
      : mLocation(location), mScale(scale), mThreshold(threshold) {}
  bool mAreParamsValid() const override { return mScale > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mHasLowerBound() const override { return mIncludeLowerBoundInGraph(); }
  double mGetLowerBound() const override { return mThreshold; }
  void mGetParameters(std::vector<double>& out) const override {
    out = {mLocation, mScale, mThreshold};
  }

 private:
  double mLocation;
  double mScale;
  double mThreshold;
};

class CmDistNormal : public CmDistScalar {
 public:
  CmDistNormal(double mean, double sigma) : mMean(mean), mSigma(sigma) {}
  bool mAreParamsValid() const override { return mSigma > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  void mGetDRefPoints(std::vector<double>& out) const override { out = {mMean}; }
  void mGetParameters(std::vector<double>& out) const override { out = {mMean, mSigma}; }

 private:
  double mMean;
  double mSigma;
  // The polar method accepts pairs: the second value waits here.
  mutable bool mHaveStored = false;
  mutable double mStored = 0.0;
};

class CmDistLogNormal : public CmDistScalar {
 public:
  CmDistLogNormal(double location, double scale, double threshold);
  ~CmDistLogNormal() override;
  void SetBrng(CmUniformGenerator* brng) override;
  bool mAreParamsValid() const override { return mScale > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mHasLowerBound() const override { return mIncludeLowerBoundInGraph(); }
  double mGetLowerBound() const override { return mThreshold; }
  void mGetParameters(std::vector<double>& out) const override {
    out = {mLocation, mScale, mThreshold};
  }

 private:
  double mLocation;
  double mScale;
  double mThreshold;
  CmDistNormal* mNormal;
};

class CmDistPoisson : public CmDistScalar {
 public:
  explicit CmDistPoisson(double mean) : mMean(mean) {}
  bool mAreParamsValid() const override { return mMean > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mIsContinuous() const override { return false; }
  void mGetSupport(double from, double to, std::vector<double>& out) const override;
  bool mHasLowerBound() const override { return true; }
  void mGetParameters(std::vector<double>& out) const override { out = {mMean}; }

 private:
  double mMean;
};

// Negative binomial: successes of probability p until the r-th. With
// failuresOnly false a draw counts the trials (failures plus the r successes,
// support from r); with it true only the failures (support from 0).
class CmDistNegBinomial : public CmDistScalar {
 public:
  CmDistNegBinomial(double p, double r, bool failuresOnly);
  ~CmDistNegBinomial() override;
  void SetBrng(CmUniformGenerator* brng) override;
  bool mAreParamsValid() const override { return mP > 0.0 && mP < 1.0 && mR > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mIsContinuous() const override { return false; }
  void mGetSupport(double from, double to, std::vector<double>& out) const override;
  bool mHasLowerBound() const override { return !mFailuresOnly; }
  double mGetLowerBound() const override { return mFailuresOnly ? 0.0 : mR; }
  void mGetParameters(std::vector<double>& out) const override {
    out = {mP, mR, mFailuresOnly ? 1.0 : 0.0};
  }

 protected:
  // For the geometric: its own mixing distribution.
  CmDistNegBinomial(double p, double r, bool failuresOnly, CmDist* mixing);
  // Shift between the trial count of the kernels and the count drawn.
  double mShift() const { return mFailuresOnly ? mR : 0.0; }

  double mP;
  double mR;
  bool mFailuresOnly;
  CmDist* mMixing;
};

class CmDistGeometric : public CmDistNegBinomial {
 public:
  CmDistGeometric(double p, bool failuresOnly);
  void mGetParameters(std::vector<double>& out) const override {
    out = {mP, mFailuresOnly ? 1.0 : 0.0};
  }
};

class CmDistSmallestExtremeValue;

class CmDistT : public CmDistScalar {
 public:
  CmDistT(double df, double noncentrality);
  ~CmDistT() override;
  void SetBrng(CmUniformGenerator* brng) override;
  bool mAreParamsValid() const override { return mDf > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  void mGetDRefPoints(std::vector<double>& out) const override { out = {mNoncentrality}; }
  void mGetParameters(std::vector<double>& out) const override { out = {mDf, mNoncentrality}; }
  void mGetNonInvCDFParameters(std::vector<double>& out) const override { out = {mDf}; }

 private:
  double mDf;
  double mNoncentrality;
  CmDistF* mF;
};

class CmDistTriangular : public CmDistScalar {
 public:
  CmDistTriangular(double lower, double mode, double upper)
      : mLower(lower), mMode(mode), mUpper(upper) {}
  bool mAreParamsValid() const override {
    return mLower <= mMode && mMode <= mUpper && mLower < mUpper;
  }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  void mGetDRefPoints(std::vector<double>& out) const override { out = {mLower, mMode, mUpper}; }
  bool mHasLowerBound() const override { return true; }
  bool mHasUpperBound() const override { return true; }
  double mGetLowerBound() const override { return mLower; }
  double mGetUpperBound() const override { return mUpper; }
  void mGetParameters(std::vector<double>& out) const override { out = {mLower, mMode, mUpper}; }

 private:
  double mLower;
  double mMode;
  double mUpper;
};

class CmDistUniform : public CmDistScalar {
 public:
  CmDistUniform(double lower, double upper) : mLower(lower), mUpper(upper) {}
  bool mAreParamsValid() const override { return mLower < mUpper; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  void mGetDRefPoints(std::vector<double>& out) const override { out = {mLower, mUpper}; }
  bool mHasLowerBound() const override { return true; }
  bool mHasUpperBound() const override { return true; }
  double mGetLowerBound() const override { return mLower; }
  double mGetUpperBound() const override { return mUpper; }
  void mGetParameters(std::vector<double>& out) const override { out = {mLower, mUpper}; }

 private:
  double mLower;
  double mUpper;
};

class CmDistWeibull : public CmDistScalar {
 public:
  CmDistWeibull(double shape, double scale, double threshold)
      : mShape(shape), mScale(scale), mThreshold(threshold) {}
  bool mAreParamsValid() const override { return mShape > 0.0 && mScale > 0.0; }
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mHasLowerBound() const override { return mIncludeLowerBoundInGraph(); }
  double mGetLowerBound() const override { return mThreshold; }
  void mGetParameters(std::vector<double>& out) const override {
    out = {mShape, mScale, mThreshold};
  }

 private:
  double mShape;
  double mScale;
  double mThreshold;
};

// A finite table of values and probabilities. Draws by Walker's alias method,
// its tables built at the first draw.
class CmDistDiscrete : public CmDistScalar {
 public:
  CmDistDiscrete(const double* values, const double* probabilities, unsigned count);
  double mPdf(double x) const override;
  double mCdf(double x, bool upperTail) const override;
  double mInvCdf(double p) const override;
  double mGetRandom() const override;
  bool mIsContinuous() const override { return false; }
  void mGetSupport(double from, double to, std::vector<double>& out) const override;
  bool mHasLowerBound() const override { return !mProbability.empty(); }
  bool mHasUpperBound() const override { return !mProbability.empty(); }
  double mGetLowerBound() const override;
  double mGetUpperBound() const override;
  void mGetParameters(std::vector<double>& out) const override;

 private:
  void mSetUpForRandom() const;

  std::map<double, double> mProbability;
  std::map<double, double> mCumulative;
  std::multimap<double, double> mValueAtCumulative;
  mutable bool mReady = false;
  mutable std::vector<double> mKeys;
  mutable std::vector<double> mThreshold;
  mutable std::vector<unsigned> mAlias;
};

// Multivariate normal: out = mean + L z with L the lower Cholesky factor of
// the covariance (given as its lower triangle packed by rows).
class CmDistMVNormal : public CmDist {
 public:
  CmDistMVNormal(const double* mean, const double* covariance, unsigned dimension);
  ~CmDistMVNormal() override;
  void SetBrng(CmUniformGenerator* brng) override;
  bool mAreParamsValid() const override { return mMsgCode == 0; }
  double mPdf(double) const override { return 0.0; }
  double mCdf(double, bool) const override { return 0.0; }
  double mInvCdf(double) const override { return 0.0; }
  double mGetRandom() const override { return 0.0; }
  void mGetRandom(std::vector<double>& out) override;

 private:
  std::vector<double> mMean;
  unsigned mDimension;
  UTmatrix<double>* mFactor;
  CmDistNormal* mNormal;
};

}  // namespace qel

#endif
