// Distribution objects of the discrete families and the multivariate normal.
//
//   Bernoulli, binomial: u <= p counts a success, one uniform per trial.
//   Poisson: inversion through the quantile kernel.
//   Negative binomial: the gamma-Poisson mixture (a Poisson count whose mean is
//     a gamma draw of shape r and scale (1 - p)/p counts the failures).
//   Hypergeometric: sequential sampling without replacement.
//   Finite tables: Walker's alias method (Walker 1977, ACM TOMS 3).
//   Multivariate normal: mean + L z with L the Cholesky factor.
#include <algorithm>
#include <cmath>
#include <new>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/classes.h"
#include "utilities/distributions/kernels.h"

namespace qel {
namespace {

// Integers in [from, to] clipped to [lower, upper], ascending.
void listIntegers(double from, double to, double lower, double upper, std::vector<double>& out) {
  out.clear();
  const double first = std::max(std::ceil(from), lower);
  const double last = std::min(std::floor(to), upper);
  for (double k = first; k <= last; k += 1.0) out.push_back(k);
}

}  // namespace

// ---------------------------------------------------------------------------

bool CmDistBernoulli::mAreParamsValid() const {
  return mP >= 0.0 && mP <= 1.0;
}

double CmDistBernoulli::mPdf(double x) const {
  return mBinomialPdf(x, 1, mP);
}
double CmDistBernoulli::mCdf(double x, bool upperTail) const {
  return mBinomialCdf(x, 1.0, mP, upperTail);
}
// The smallest k with P(X <= k) >= p.
double CmDistBernoulli::mInvCdf(double p) const {
  return p <= 1.0 - mP ? 0.0 : 1.0;
}
double CmDistBernoulli::mGetRandom() const {
  return mUniform() <= mP ? 1.0 : 0.0;
}
void CmDistBernoulli::mGetSupport(double from, double to, std::vector<double>& out) const {
  listIntegers(from, to, 0.0, 1.0, out);
}

// ---------------------------------------------------------------------------

double CmDistBinomial::mPdf(double x) const {
  return mBinomialPdf(x, mN, mP);
}
double CmDistBinomial::mCdf(double x, bool upperTail) const {
  return mBinomialCdf(x, mN, mP, upperTail);
}

double CmDistBinomial::mInvCdf(double p) const {
  return mBinomialInvCdf(p, mN, mP);
}

// Up to this many trials a draw counts Bernoulli trials; beyond, it inverts
// the distribution function at one uniform, so that a draw of INT_MAX
// trials costs one quantile search instead of 2^31 uniforms.
constexpr int kLargestCountedTrials = 10000;

// The smallest k with P(X <= k) >= u, by bisection on whole numbers within
// mean +- 40 sd (the tails beyond hold less than 1e-300): for trial counts
// beyond the ELV quantile routine's range.
static double binomialQuantileByBisection(double u, int n, double p) {
  const double mean = n * p, sd = std::sqrt(n * p * (1.0 - p));
  double lo = std::max(-1.0, std::floor(mean - 40.0 * sd)),
         hi = std::min(1.0 * n, std::ceil(mean + 40.0 * sd));
  while (hi - lo > 1.0) {
    const double mid = std::floor(lo + (hi - lo) / 2.0);
    const double f = mBinomialCdf(mid, n, p, false);
    if (mIsNumericMissing(f)) return f;
    (f >= u ? hi : lo) = mid;
  }
  return hi;
}

double CmDistBinomial::mGetRandom() const {
  if (mN > kLargestCountedTrials) {
    const double u = mUniform();
    const double k = mBinomialInvCdf(u, mN, mP);
    return mIsNumericMissing(k) ? binomialQuantileByBisection(u, mN, mP) : k;
  }
  int k = 0;
  for (int i = 0; i < mN; ++i)
    if (mUniform() <= mP) ++k;
  return k;
}

void CmDistBinomial::mGetSupport(double from, double to, std::vector<double>& out) const {
  listIntegers(from, to, 0.0, mN, out);
}

// ---------------------------------------------------------------------------

double CmDistPoisson::mPdf(double x) const {
  return mPoissonPdf(x, mMean);
}
double CmDistPoisson::mCdf(double x, bool upperTail) const {
  return mPoissonCdf(x, mMean, upperTail);
}
double CmDistPoisson::mInvCdf(double p) const {
  return mPoissonInvCdf(p, mMean);
}
double CmDistPoisson::mGetRandom() const {
  return mPoissonInvCdf(mUniform(), mMean);
}
void CmDistPoisson::mGetSupport(double from, double to, std::vector<double>& out) const {
  listIntegers(from, to, 0.0, to, out);
}

// ---------------------------------------------------------------------------

CmDistNegBinomial::CmDistNegBinomial(double p, double r, bool failuresOnly)
    : mP(p),
      mR(r),
      mFailuresOnly(failuresOnly),
      mMixing(new CmDistGamma(r, p > 0.0 ? (1.0 - p) / p : 0.0, 0.0)) {}

CmDistNegBinomial::CmDistNegBinomial(double p, double r, bool failuresOnly, CmDist* mixing)
    : mP(p), mR(r), mFailuresOnly(failuresOnly), mMixing(mixing) {}

CmDistNegBinomial::~CmDistNegBinomial() {
  delete mMixing;
}

void CmDistNegBinomial::SetBrng(CmUniformGenerator* brng) {
  CmDist::SetBrng(brng);
  mMixing->SetBrng(brng);
}

// The kernels count trials: a failure count x is the trial count x + r.
double CmDistNegBinomial::mPdf(double x) const {
  return mNegBinomialPdf(x + mShift(), mP, mR);
}
double CmDistNegBinomial::mCdf(double x, bool upperTail) const {
  return mNegBinomialCdf(x + mShift(), mP, mR, upperTail);
}
double CmDistNegBinomial::mInvCdf(double p) const {
  const double k = mNegBinomialInvCdf(p, mP, mR);
  return mIsNumericMissing(k) ? k : k - mShift();
}

double CmDistNegBinomial::mGetRandom() const {
  if (!mAreParamsValid()) {
    mMsgCode = qelFailRandomVariate;
    return mGetMissingValueCode();
  }
  const double mean = mMixing->mGetRandom();
  if (mMixing->GetMsgCode() != 0) mMsgCode = mMixing->GetMsgCode();
  CmDistPoisson poisson(mean);
  poisson.SetBrng(mBrng);
  // A mean of 0 (possible for tiny r) is a certain 0; the uniform is drawn
  // all the same, so that the stream does not depend on the value.
  double k = poisson.mGetRandom();
  if (!(mean > 0.0)) k = 0.0;
  if (mIsNumericMissing(k)) mMsgCode = qelFailRandomVariate;
  return mFailuresOnly ? k : k + mR;
}

void CmDistNegBinomial::mGetSupport(double from, double to, std::vector<double>& out) const {
  try {
    listIntegers(from, to, mGetLowerBound(), to, out);
  } catch (...) {
    out.clear();
  }
}

CmDistGeometric::CmDistGeometric(double p, bool failuresOnly)
    : CmDistNegBinomial(p, 1.0, failuresOnly,
                        new CmDistExponential(p > 0.0 ? (1.0 - p) / p : 0.0, 0.0)) {}

// ---------------------------------------------------------------------------

double CmDistHypergeometric::mPdf(double x) const {
  return mHypergeometricPdf(x, mN, mM, mSample);
}
double CmDistHypergeometric::mCdf(double x, bool upperTail) const {
  return mHypergeometricCdf(x, mN, mM, mSample, upperTail);
}
double CmDistHypergeometric::mInvCdf(double p) const {
  return mHypergeometricInvCdf(p, mN, mM, mSample);
}
double CmDistHypergeometric::mGetLowerBound() const {
  return std::max(0, mM + mSample - mN);
}
double CmDistHypergeometric::mGetUpperBound() const {
  return std::min(mM, mSample);
}

// Draw the sample one member at a time: a marked member comes with
// probability (marked left)/(population left).
double CmDistHypergeometric::mGetRandom() const {
  double remaining = mN, marked = mM;
  int k = 0;
  for (int i = 0; i < mSample; ++i) {
    if (marked == 0.0) break;
    if (marked == remaining) {
      k += mSample - i;
      break;
    }
    if (mUniform() <= marked / remaining) {
      ++k;
      marked -= 1.0;
    }
    remaining -= 1.0;
  }
  return k;
}

void CmDistHypergeometric::mGetSupport(double from, double to, std::vector<double>& out) const {
  listIntegers(from, to, mGetLowerBound(), mGetUpperBound(), out);
}

// ---------------------------------------------------------------------------

double CmDistIntegerUniform::mPdf(double x) const {
  return mIntegerUniformPdf(x, mA, mB);
}
double CmDistIntegerUniform::mCdf(double x, bool upperTail) const {
  return mIntegerUniformCdf(x, mA, mB, upperTail);
}
double CmDistIntegerUniform::mInvCdf(double p) const {
  return mIntegerUniformInvCdf(p, mA, mB);
}
double CmDistIntegerUniform::mGetRandom() const {
  const double u = mUniform();
  if (u == 0.0) return mA;
  if (u == 1.0) return mB;
  return std::ceil(mA + u * (double(mB) - mA + 1.0) - 1.0);
}
void CmDistIntegerUniform::mGetSupport(double from, double to, std::vector<double>& out) const {
  listIntegers(from, to, mA, mB, out);
}

// ---------------------------------------------------------------------------

CmDistDiscrete::CmDistDiscrete(const double* values, const double* probabilities, unsigned count) {
  // A repeated value keeps its first probability, as the Discrete kernels do.
  for (unsigned i = 0; i < count; ++i) mProbability.insert({values[i], probabilities[i]});
  double running = 0.0;
  for (const auto& entry : mProbability) {
    running += entry.second;
    mCumulative[entry.first] = running;
    mValueAtCumulative.insert({running, entry.first});
  }
}

double CmDistDiscrete::mPdf(double x) const {
  return mDiscretePdf(x, mProbability);
}
double CmDistDiscrete::mCdf(double x, bool upperTail) const {
  return mDiscreteCdf(x, mProbability, upperTail);
}
double CmDistDiscrete::mInvCdf(double p) const {
  return mDiscreteInvCdf(p, mValueAtCumulative);
}
double CmDistDiscrete::mGetLowerBound() const {
  return mProbability.empty() ? 0.0 : mProbability.begin()->first;
}
double CmDistDiscrete::mGetUpperBound() const {
  return mProbability.empty() ? 0.0 : mProbability.rbegin()->first;
}
void CmDistDiscrete::mGetParameters(std::vector<double>& out) const {
  out.clear();
  for (const auto& entry : mProbability) {
    out.push_back(entry.first);
    out.push_back(entry.second);
  }
}
void CmDistDiscrete::mGetSupport(double from, double to, std::vector<double>& out) const {
  out.clear();
  for (auto it = mProbability.lower_bound(from); it != mProbability.end() && it->first <= to; ++it)
    out.push_back(it->first);
}

// Walker's tables: cell j keeps its own outcome with probability
// threshold[j] and hands the rest to alias[j]. Probabilities are scaled by K
// over their sum; the last entry below 1 is paired with the last above.
void CmDistDiscrete::mSetUpForRandom() const {
  const std::size_t k = mProbability.size();
  mKeys.clear();
  mThreshold.clear();
  double sum = 0.0;
  for (const auto& entry : mProbability) {
    mKeys.push_back(entry.first);
    mThreshold.push_back(entry.second);
    sum += entry.second;
  }
  mAlias.resize(k);
  std::vector<unsigned> small, large;
  const double tolerance = mGetEps(false);
  for (std::size_t j = 0; j < k; ++j) {
    mAlias[j] = static_cast<unsigned>(j);
    mThreshold[j] *= k / sum;
    (mThreshold[j] < 1.0 - tolerance ? small : large).push_back(static_cast<unsigned>(j));
  }
  while (!small.empty() && !large.empty()) {
    const unsigned s = small.back(), l = large.back();
    small.pop_back();
    mAlias[s] = l;
    mThreshold[l] -= 1.0 - mThreshold[s];
    if (mThreshold[l] < 1.0 - tolerance) {
      large.pop_back();
      small.push_back(l);
    }
  }
  // What is left is 1 within rounding: the cell keeps its own outcome.
  for (unsigned j : small) mThreshold[j] = 1.0;
  for (unsigned j : large) mThreshold[j] = 1.0;
  mReady = true;
}

double CmDistDiscrete::mGetRandom() const {
  if (!mReady) mSetUpForRandom();
  if (mKeys.empty()) return mGetMissingValueCode();
  const double x = mUniform() * mKeys.size();
  const std::size_t j = static_cast<std::size_t>(std::floor(x));
  return mThreshold[j] >= j + 1.0 - x ? mKeys[j] : mKeys[mAlias[j]];
}

// ---------------------------------------------------------------------------

CmDistMVNormal::CmDistMVNormal(const double* mean, const double* covariance, unsigned dimension)
    : mMean(mean, mean + dimension),
      mDimension(dimension),
      mFactor(nullptr),
      mNormal(new CmDistNormal(0.0, 1.0)) {
  try {
    const Smatrix<double> sigma(static_cast<int>(dimension), covariance);
    mFactor = new UTmatrix<double>(sigma.CholeskyDecomp());
  } catch (const std::domain_error&) {
    mMsgCode = qelFailNotPositiveDefinite;
  } catch (const std::bad_alloc&) {
    mMsgCode = qelFailOutOfMemory;
  }
}

CmDistMVNormal::~CmDistMVNormal() {
  delete mFactor;
  delete mNormal;
}

void CmDistMVNormal::SetBrng(CmUniformGenerator* brng) {
  CmDist::SetBrng(brng);
  mNormal->SetBrng(brng);
}

// U'U is the covariance, so the lower factor is U': out = mean + U' z.
void CmDistMVNormal::mGetRandom(std::vector<double>& out) {
  if (mFactor == nullptr) {
    out.assign(mDimension, mGetMissingValueCode());
    return;
  }
  std::vector<double> z(mDimension);
  for (double& value : z) value = mNormal->mGetRandom();
  out = static_cast<std::vector<double>>(mFactor->transpose() * z + mMean);
}

}  // namespace qel
