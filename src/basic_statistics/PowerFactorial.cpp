// Two-level factorial, Plackett-Burman and general full factorial power.
//
// An effect of a two-level design (the difference between the means at the
// high and the low level) is estimated from N = r x runs per replicate runs
// with variance 4 sigma^2 / N, so its F test has noncentrality
// N (effect / (2 sigma))^2 on 1 and the error df. A general full factorial
// is tested as groups with sum of squares of means s about their mean,
// noncentrality s (N / groups) / sigma^2 (Cohen 1988, ch. 8). The
// replicate and center-point solves find the smallest whole count whose
// power reaches the target by doubling and halving a bracket on whole
// numbers: the power rises with both counts.
#include "basic_statistics/PowerFactorial.h"

#include <algorithm>
#include <cmath>
#include <cstdint>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"

namespace qel {

namespace {

const double kMissing = mGetMissingValueCode();
const int kNotReached = 999999;
// Error df beyond this leave the range where the noncentral F is accurate.
const double kMaxErrorDF = 189812531.0;

bool isNumber(double x) {
  return std::isfinite(x) && !mIsNumericMissing(x);
}

bool reaches(double power, double target) {
  return isNumber(power) && (power >= target || mEqualWithinFuzz(power, target, 1e-10));
}

// The upper-tail F test power at noncentrality ncp.
double fTestPower(double df1, double df2, double ncp, double level) {
  if (!(df1 > 0.0) || !(df2 > 0.0) || !(level > 0.0 && level < 1.0) || !isNumber(ncp) ||
      ncp < 0.0) {
    return kMissing;
  }
  const double c = mFInvCdf(1.0 - level, df1, df2, 0.0);
  if (!isNumber(c)) return kMissing;
  const double p = mFCdf(c, df1, df2, ncp, true);
  return isNumber(p) ? std::min(std::max(p, 0.0), 1.0) : kMissing;
}

// The smallest whole x in [lo, hi] with reached(x), or hi + 1 if none:
// reached must be monotone. Doubles from lo, then halves the bracket.
template <typename F>
std::int64_t smallestReaching(std::int64_t lo, std::int64_t hi, F reached) {
  if (lo > hi) return hi + 1;
  if (reached(lo)) return lo;
  std::int64_t below = lo, above = lo;
  for (;;) {
    if (above >= hi) return hi + 1;
    above = std::min(hi, 2 * above + 1);
    if (reached(above)) break;
    below = above;
  }
  while (above - below > 1) {
    const std::int64_t mid = below + (above - below) / 2;
    if (reached(mid))
      above = mid;
    else
      below = mid;
  }
  return above;
}

// x of 0.5 x^2 + 4.365535845689506 x + (df / 2 - 94906265), the search end
// of an effect with these error df.
double effectEndRoot(double df) {
  return mRootOfQuadratic(0.5, 4.365535845689506, df / 2.0 - 94906265.0);
}

// The root of power(x) - target on [0, upper], power rising in x. The
// bracket grows by doubling from start, so that the noncentral F (whose
// cost grows with the noncentrality) is never asked far beyond the root.
// A target not reached at upper gives upper, or the missing value when
// missingAtTop is set.
double effectRoot(CmRealFunction& f, double start, double upper, bool missingAtTop) {
  if (!isNumber(upper) || !(upper > 0.0) || !(start > 0.0)) return kMissing;
  double lo = 0.0, hi = std::min(start, upper);
  double fHi = f(hi);
  while (!(isNumber(fHi) && fHi >= 0.0)) {
    if (hi >= upper) return missingAtTop ? kMissing : upper;
    lo = hi;
    hi = std::min(2.0 * hi, upper);
    fHi = f(hi);
  }
  if (fHi == 0.0) return hi;
  int status = 0;
  const double root = mRootFinder(lo, hi, f, &status);
  return status == 0 ? root : kMissing;
}

}  // namespace

unsigned GetMaxBlocks(unsigned factors, unsigned runs) {
  switch (runs) {
    case 4:
      return factors == 2 ? 2 : 1;
    case 8:
      if (factors == 3 || factors == 4) return 4;
      return factors == 5 || factors == 6 ? 2 : 1;
    case 16:
      if (factors >= 4 && factors <= 8) return 8;
      if (factors >= 9 && factors <= 12) return 4;
      if (factors == 13 || factors == 14) return 2;
      return factors == 15 ? 1 : 0;
    case 32:
      return factors == 5 || factors == 6 ? 16 : 8;
    case 64:
      return factors == 6 ? 32 : 16;
    case 128:
      if (factors == 7) return 64;
      return factors == 8 ? 32 : 16;
    default:
      return 0;
  }
}

int mGetNonConfoundedDFBlock(int replicates, int blocks, bool blocksInModel) {
  if (!blocksInModel || blocks <= 1 || replicates < 1) return 0;
  for (std::int64_t t = 1; t <= blocks; t *= 2) {
    if ((static_cast<std::int64_t>(replicates) * t) % blocks == 0) {
      return blocks - static_cast<int>(t);
    }
  }
  // No power of two up to blocks makes a multiple (blocks not a power of
  // two): no block df is free of the effects.
  return 0;
}

double mFactorialCalcOnePower(int r, int blocks, int uniqueCorners, int runsPerRep, int omitted,
                              int cpDf, double level, double sigma, double effect,
                              bool blocksInModel) {
  if (r < 1 || runsPerRep < 1 || !(sigma > 0.0) || !isNumber(effect)) return kMissing;
  const double runs = static_cast<double>(r) * runsPerRep;
  const double df =
      runs - uniqueCorners + omitted + cpDf - mGetNonConfoundedDFBlock(r, blocks, blocksInModel);
  if (!(df > 0.0)) return kMissing;
  const double q = effect / (2.0 * sigma);
  return fTestPower(1.0, df, runs * q * q, level);
}

// ---------------------------------------------------------------------------

CmCmndPowerFactorial::CmCmndPowerFactorial()
    : mRunsPerRep(0),
      mFactorCt(0),
      mBlockCt(1),
      mOmitted(0),
      mUnusedInt(0),
      mCenterPointsGiven(false),
      mCenterPointsInModel(false),
      mBlocksInModel(false),
      mPlackettBurman(false),
      mStorageCPBlock(nullptr),
      mUnusedBool(false) {}

CmCmndPowerFactorial::~CmCmndPowerFactorial() = default;

void CmCmndPowerFactorial::mSetCenterPoints(const std::vector<int>& perBlock) {
  mCenterPointList = perBlock;
  mCenterPointsGiven = true;
}

int CmCmndPowerFactorial::mGetUniqueCornerPointCt() const {
  if (!mPlackettBurman) return mRunsPerRep;
  const double corners =
      mFactorCt >= 31 || mFactorCt < 0 ? mGetMaxInteger() / 2.0 : std::ldexp(1.0, mFactorCt);
  return static_cast<int>(std::min(static_cast<double>(mRunsPerRep), corners));
}

void CmCmndPowerFactorial::mSetOmittedEffects(int t) {
  mOmitted = t + mGetUniqueCornerPointCt() - mFactorCt - 1;
}

int CmCmndPowerFactorial::mGetDFCenterPoint(int c, bool isMax) const {
  if (c == 0) return 0;
  if (isMax) return kNotReached;
  return mBlockCt * c - (mCenterPointsInModel ? 1 : 0);
}

int CmCmndPowerFactorial::mGetNonConfoundedDFBlock(int replicates) const {
  return qel::mGetNonConfoundedDFBlock(replicates, mBlockCt, mBlocksInModel);
}

double CmCmndPowerFactorial::mPowerAt(int r, int c, double effect) const {
  const int cpDf = mGetDFCenterPoint(c, false);
  if (!mIsReplicateBlockCombinationAllowed(r, mBlockCt, cpDf)) return kMissing;
  return mFactorialCalcOnePower(r, mBlockCt, mGetUniqueCornerPointCt(), mRunsPerRep, mOmitted, cpDf,
                                mLevel, mSigma, effect, mBlocksInModel);
}

int CmCmndPowerFactorial::mGetMinRepCt(int c) const {
  const int cpDf = mGetDFCenterPoint(c, false);
  if (mRunsPerRep < 1) return 1;
  // Error df grow with r by runs per replicate (less block df below blocks).
  for (int r = 1; r < 1000000; ++r) {
    const double df = static_cast<double>(r) * mRunsPerRep - mGetUniqueCornerPointCt() + mOmitted +
                      cpDf - mGetNonConfoundedDFBlock(r);
    if (df > 0.0) return r;
  }
  return 1000000;
}

int CmCmndPowerFactorial::mGetMaxRepCt(int c) const {
  if (mRunsPerRep < 1) return 0;
  return static_cast<int>(
      std::trunc((mGetMaxInteger() - static_cast<double>(mBlockCt) * c) / mRunsPerRep - 1.0));
}

int CmCmndPowerFactorial::mGetMaxRepCt(int c, double effect) const {
  const int top = mGetMaxRepCt(c);
  if (!isNumber(effect) || effect == 0.0 || !(mSigma > 0.0)) return top;
  const double r0 = effect / (2.0 * mSigma);
  const double x =
      mRootOfQuadratic(r0 * r0 / 2.0 + 0.5, r0 * 6.1738 / 1.4142135623730951, -94906265.0);
  if (!isNumber(x)) return top;
  const double reduced = mReduceUpperEnd(x);
  const double limit = std::floor(std::floor(reduced * reduced) / mGetUniqueCornerPointCt());
  return static_cast<int>(std::min(static_cast<double>(top), limit));
}

int CmCmndPowerFactorial::mGetMinCenterPntCtPerBlock(int r) const {
  const double d =
      std::max(0.0, static_cast<double>(mGetUniqueCornerPointCt()) - mOmitted -
                        static_cast<double>(mRunsPerRep) * r + 1.0 + mGetNonConfoundedDFBlock(r));
  if (d == 0.0) return 0;
  const double blocks = std::max(mBlockCt, 1);
  return static_cast<int>(std::ceil((mCenterPointsInModel ? d + 1.0 : d) / blocks));
}

int CmCmndPowerFactorial::mGetMaxCenterPntCtPerBlock(int r) const {
  const double blocks = std::max(mBlockCt, 1);
  return static_cast<int>(
      std::trunc(std::max(0.0, mGetMaxInteger() - static_cast<double>(mRunsPerRep) * r) / blocks));
}

int CmCmndPowerFactorial::mGetRequiredCenterPointCtPerBlock(int c, bool isMax) const {
  if (c == 0) return 0;
  if (isMax) return kNotReached;
  const double blocks = std::max(mBlockCt, 1);
  return static_cast<int>(std::ceil((mCenterPointsInModel ? c + 1.0 : c) / blocks));
}

bool CmCmndPowerFactorial::mIsReplicateBlockCombinationAllowed(int r, int blocks, int cpDf) const {
  const double df =
      static_cast<double>(mRunsPerRep) * r + mOmitted + cpDf -
      (mGetUniqueCornerPointCt() + qel::mGetNonConfoundedDFBlock(r, blocks, mBlocksInModel));
  return df < kMaxErrorDF;
}

int CmCmndPowerFactorial::mCalculateMinCPBlock() const {
  if (mResultCenterPoints.empty()) return 0;
  return *std::min_element(mResultCenterPoints.begin(), mResultCenterPoints.end());
}

double CmCmndPowerFactorial::mComputeXForPowerAndSampleSize(double power, int r, int c) {
  const int cpDf = mGetDFCenterPoint(c, false);
  if (!mIsReplicateBlockCombinationAllowed(r, mBlockCt, cpDf) || !(mSigma > 0.0)) return kMissing;
  const double atZero = mPowerAt(r, c, 0.0);
  if (!isNumber(atZero)) return kMissing;
  if (reaches(atZero, power)) return 0.0;
  const double runs = static_cast<double>(r) * mRunsPerRep;
  const double df =
      runs - mGetUniqueCornerPointCt() + mOmitted + cpDf - mGetNonConfoundedDFBlock(r);
  const double x = effectEndRoot(df);
  CmFactorialPower f(*this, r, c, 0.0, power, false, false);
  const double se = 2.0 * mSigma / std::sqrt(runs);
  return effectRoot(f, se, mReduceUpperEnd(x * se), false);
}

int CmCmndPowerFactorial::mSmallestReplicates(double effect, double power, int c) const {
  if (!isNumber(effect) || effect == 0.0 || !(mSigma > 0.0) || mRunsPerRep < 1) return -1;
  const std::int64_t lo = mGetMinRepCt(c);
  std::int64_t hi = mGetMaxRepCt(c, effect);
  // Keep the error df within the range of the noncentral F.
  hi = std::min<std::int64_t>(hi, static_cast<std::int64_t>(kMaxErrorDF / mRunsPerRep) - 1);
  const std::int64_t r = smallestReaching(lo, hi, [&](std::int64_t k) {
    return reaches(mPowerAt(static_cast<int>(k), c, effect), power);
  });
  return r > hi ? -1 : static_cast<int>(r);
}

int CmCmndPowerFactorial::mSmallestCenterPoints(double effect, double power, int r) const {
  if (!isNumber(effect) || !(mSigma > 0.0) || mRunsPerRep < 1) return -1;
  const std::int64_t lo = mGetMinCenterPntCtPerBlock(r);
  const std::int64_t hi =
      std::min<std::int64_t>(mGetMaxCenterPntCtPerBlock(r),
                             static_cast<std::int64_t>(kMaxErrorDF / std::max(mBlockCt, 1)) - 1);
  const std::int64_t c = smallestReaching(lo, hi, [&](std::int64_t k) {
    return reaches(mPowerAt(r, static_cast<int>(k), effect), power);
  });
  return c > hi ? kNotReached : static_cast<int>(c);
}

void CmCmndPowerFactorial::mStoreRow(int row, int r, double effect, double power, int cp,
                                     double target) {
  CmCmndPower::mStoreRow(row, r, effect, power, target);
  mResultCenterPoints.push_back(cp);
  if (!mCenterPointsGiven && mSampleSizesGiven) mTargetPowers.push_back(target);
  if (mStorageCPBlock && row >= 1 && static_cast<std::size_t>(row) <= mStorageCPBlock->size()) {
    (*mStorageCPBlock)[static_cast<std::size_t>(row - 1)] =
        cp < 0 || cp == kNotReached ? kMissing : cp;
  }
  const double total = static_cast<double>(std::max(cp, 0)) * mBlockCt +
                       static_cast<double>(std::max(r, 0)) * mRunsPerRep;
  mResultTotalRuns.push_back(total < 2147483647.0 ? static_cast<int>(total) : -1);
  const EErrorType kind = mGetErrorType(r, cp, effect, power);
  mErrorTypes.push_back(kind);
  if (kind == eNoErrorDF) mNoErrorDFRows.push_back(row);
  if (kind == eTargetNotReached) mNotReachedRows.push_back(row);
  if (kind == eTooManyRuns) mTooManyRunsRows.push_back(row);
}

EErrorType CmCmndPowerFactorial::mGetErrorType(int r, int cp, double effect, double power) const {
  if (r == kNotReached || cp == kNotReached) return eTargetNotReached;
  if (isNumber(effect) && isNumber(power)) return eNoError;
  // A replicate solve that finds no count reaching the target stores -1.
  const bool solvable = isNumber(effect) && mSigma > 0.0 && mRunsPerRep >= 1;
  if (r < 1 && !mSampleSizesGiven && solvable) return eTargetNotReached;
  if (r < 1 || cp < 0) return eNotComputable;
  // The error df, as the F test of mFactorialCalcOnePower counts them.
  const int cpDf = mGetDFCenterPoint(cp, false);
  if (!mIsReplicateBlockCombinationAllowed(r, mBlockCt, cpDf)) return eTooManyRuns;
  const double df = static_cast<double>(mRunsPerRep) * r - mGetUniqueCornerPointCt() + mOmitted +
                    cpDf - mGetNonConfoundedDFBlock(r);
  return df <= 0.0 ? eNoErrorDF : eNotComputable;
}

bool CmCmndPowerFactorial::mComputeAndStore() {
  int row = 1;
  const std::vector<int> cps = mCenterPointsGiven ? mCenterPointList : std::vector<int>{0};
  if (!mEffectsGiven) {
    for (int c : cps) {
      for (int r : mSampleSizeList) {
        for (double p : mPowerList) {
          mStoreRow(row++, r, mComputeXForPowerAndSampleSize(p, r, c), p, c, p);
        }
      }
    }
  } else if (!mPowersGiven) {
    for (int c : cps) {
      for (double e : mEffectList) {
        for (int r : mSampleSizeList) mStoreRow(row++, r, e, mPowerAt(r, c, e), c, 0.0);
      }
    }
  } else if (!mSampleSizesGiven) {
    for (int c : cps) {
      for (double e : mEffectList) {
        for (double p : mPowerList) {
          const int r = mSmallestReplicates(e, p, c);
          mStoreRow(row++, r, e, r > 0 ? mPowerAt(r, c, e) : kMissing, c, p);
        }
      }
    }
  } else if (!mCenterPointsGiven) {
    for (int r : mSampleSizeList) {
      for (double e : mEffectList) {
        for (double p : mPowerList) {
          const int c = mSmallestCenterPoints(e, p, r);
          const double q = c >= 0 && c != kNotReached ? mPowerAt(r, c, e) : kMissing;
          mStoreRow(row++, r, e, q, c, p);
        }
      }
    }
  }
  return true;
}

void CmCmndPowerFactorial::mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin,
                                                 double* xMax) {
  const int n = std::max(mGetMinN(), 1);
  double d = mComputeXForPowerAndSampleSize(0.99, n, mCalculateMinCPBlock());
  if (!isNumber(d)) d = mGetDefaultDiffForSigma(static_cast<unsigned>(n));
  *xMin = -d;
  *xMax = d;
  mGetSuggestedDataXMinXMax(data, xMin, xMax);
  mAdjustForEqualSuggestedMinMax(*xMin, xMax);
}

CmFactorialPower::CmFactorialPower(const CmCmndPowerFactorial& design, int r, int c, double effect,
                                   double target, bool xIsReplicates, bool xIsCenterPoints)
    : mDesign(design),
      mR(r),
      mC(c),
      mEffect(effect),
      mXIsReplicates(xIsReplicates),
      mXIsCenterPoints(xIsCenterPoints) {
  mTarget = target;
  mIntegerValued = xIsReplicates || xIsCenterPoints;
}

double CmFactorialPower::operator()(double x) {
  double p;
  if (mXIsReplicates || mXIsCenterPoints) {
    const int k = mSampleSizeFromDouble(x);
    if (k < 0) return kMissing;
    p = mXIsReplicates ? mDesign.mPowerAt(k, mC, mEffect) : mDesign.mPowerAt(mR, k, mEffect);
  } else {
    p = mDesign.mPowerAt(mR, mC, x);
  }
  return isNumber(p) ? p - mTarget : kMissing;
}

// ---------------------------------------------------------------------------

double mGetModelDF(int r, const std::vector<int>& levels, unsigned order, bool blocks) {
  double df = blocks ? r : 1.0;
  const int k = static_cast<int>(levels.size());
  const int top = static_cast<int>(std::min<unsigned>(order, static_cast<unsigned>(k)));
  std::vector<int> subset;
  for (int size = 1; size <= top; ++size) {
    CmSubsetsOfNChooseK subsets;
    const int count = subsets.mInitialize(k, size);
    for (int i = 0; i < count; ++i) {
      subsets.mNextSubset(subset);
      double term = 1.0;
      for (int f : subset) term *= levels[static_cast<std::size_t>(f)] - 1.0;
      df += term;
    }
  }
  return df;
}

double mGetDenomDF(int r, const std::vector<int>& levels, unsigned order, bool blocks) {
  return r * mGetTotalNumberOfCells(levels) - mGetModelDF(r, levels, order, blocks);
}

double mGetMaxDifference(double s) {
  return isNumber(s) && s >= 0.0 ? std::sqrt(2.0 * s) : kMissing;
}

double mGetSSMeans(double d) {
  return isNumber(d) ? d * d / 2.0 : kMissing;
}

double mOnewayCalcOnePower(int groups, int r, const std::vector<int>& levels, int order,
                           bool blocks, double level, double sigma, double ssMeans) {
  if (groups < 2 || r < 1 || !(sigma > 0.0) || !isNumber(ssMeans) || ssMeans < 0.0) {
    return kMissing;
  }
  for (int l : levels) {
    if (l < 2) return kMissing;
  }
  const double n = r * mGetTotalNumberOfCells(levels);
  const double df = n - mGetModelDF(r, levels, static_cast<unsigned>(std::max(order, 0)), blocks);
  if (!(df > 0.0) || !(df < kMaxErrorDF)) return kMissing;
  const double perGroup = std::floor(n / groups);
  return fTestPower(groups - 1.0, df, ssMeans * perGroup / (sigma * sigma), level);
}

CmCmndPowerGFF::CmCmndPowerGFF()
    : mUnusedInt(3),
      mStorageTotalRuns(nullptr),
      mUnusedBool(false),
      mGroupCt(0),
      mUnusedBool2(false),
      mOrder(~0u),
      mBlocks(false) {}

CmCmndPowerGFF::~CmCmndPowerGFF() = default;

bool CmCmndPowerGFF::mLevelsUsable() const {
  if (mLevels.empty() || mGroupCt < 2) return false;
  for (int l : mLevels) {
    if (l < 2) return false;
  }
  return isNumber(mCells()) && mCells() < kMaxErrorDF;
}

double CmCmndPowerGFF::mCells() const {
  return mGetTotalNumberOfCells(mLevels);
}

double CmCmndPowerGFF::mPowerAt(int r, double s) const {
  if (!mLevelsUsable()) return kMissing;
  return mOnewayCalcOnePower(mGroupCt, r, mLevels, static_cast<int>(std::min(mOrder, 64u)), mBlocks,
                             mLevel, mSigma, s);
}

void CmCmndPowerGFF::mCalculateEffectsFromMeans(const std::vector<std::vector<double>>& means) {
  mEffectList.clear();
  for (const auto& m : means) {
    if (m.empty()) {
      mEffectList.push_back(kMissing);
      continue;
    }
    double mean = 0.0;
    for (double x : m) mean += x;
    mean /= static_cast<double>(m.size());
    double ss = 0.0;
    for (double x : m) ss += (x - mean) * (x - mean);
    mEffectList.push_back(ss);
  }
  mEffectsGiven = true;
}

void CmCmndPowerGFF::mCalculateEffectsFromMaxDiff(const std::vector<double>& differences) {
  mDifferences = differences;
  mEffectList.clear();
  for (double d : differences) mEffectList.push_back(mGetSSMeans(d));
  mEffectsGiven = true;
}

double CmCmndPowerGFF::mComputeXForPowerAndSampleSize(double power, int r) const {
  const double atZero = mPowerAt(r, 0.0);
  if (!isNumber(atZero)) return kMissing;
  if (reaches(atZero, power)) return 0.0;
  const double x =
      mRootOfQuadratic(0.5, 4.365535845689506, (r - 1.0) * mGroupCt * 0.5 - 94906265.0);
  CmOnewayPower f(*this, r, 0.0, power, false);
  return effectRoot(f, mSigma * mSigma / r, mReduceUpperEnd((x * mSigma) * (x * mSigma) / r), true);
}

int CmCmndPowerGFF::mComputeXForPowerAndEffect(double power, double s) const {
  if (!mLevelsUsable() || !isNumber(s) || !(s > 0.0)) return -1;
  const std::int64_t lo = mGetDenomDF(1, mLevels, mOrder, mBlocks) > 0.0 ? 1 : 2;
  const std::int64_t hi = static_cast<std::int64_t>(kMaxErrorDF / mCells()) - 1;
  const std::int64_t r = smallestReaching(
      lo, hi, [&](std::int64_t k) { return reaches(mPowerAt(static_cast<int>(k), s), power); });
  return r > hi ? -1 : static_cast<int>(r);
}

void CmCmndPowerGFF::mStoreTotalRuns(int row, int runs) {
  mResultTotalRuns.push_back(runs);
  if (mStorageTotalRuns && row >= 1 && static_cast<std::size_t>(row) <= mStorageTotalRuns->size()) {
    (*mStorageTotalRuns)[static_cast<std::size_t>(row - 1)] = runs < 0 ? kMissing : runs;
  }
}

bool CmCmndPowerGFF::mComputeAndStore() {
  int row = 1;
  auto totalRuns = [&](int r) {
    const double t = r > 0 && mLevelsUsable() ? r * mCells() : -1.0;
    return t >= 0.0 && t < 2147483647.0 ? static_cast<int>(t) : -1;
  };
  if (!mEffectsGiven) {
    for (int r : mSampleSizeList) {
      for (double p : mPowerList) {
        mStoreRow(row, r, mGetMaxDifference(mComputeXForPowerAndSampleSize(p, r)), p, p);
        mStoreTotalRuns(row++, totalRuns(r));
      }
    }
  } else if (!mPowersGiven) {
    for (double s : mEffectList) {
      for (int r : mSampleSizeList) {
        mStoreRow(row, r, mGetMaxDifference(s), mPowerAt(r, s), 0.0);
        mStoreTotalRuns(row++, totalRuns(r));
      }
    }
  } else if (!mSampleSizesGiven) {
    for (double s : mEffectList) {
      for (double p : mPowerList) {
        const int r = mComputeXForPowerAndEffect(p, s);
        mStoreRow(row, r, mGetMaxDifference(s), r > 0 ? mPowerAt(r, s) : kMissing, p);
        mStoreTotalRuns(row++, totalRuns(r));
      }
    }
  }
  return true;
}

void CmCmndPowerGFF::mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin,
                                           double* xMax) {
  const int n = std::max(mGetMinN(), 1);
  double d = mGetMaxDifference(mComputeXForPowerAndSampleSize(mGetHighPower(), n));
  if (!isNumber(d)) d = mGetDefaultDiffForSigma(static_cast<unsigned>(n));
  *xMin = 0.0;
  *xMax = d;
  mGetSuggestedDataXMinXMax(data, xMin, xMax);
  mAdjustForEqualSuggestedMinMax(*xMin, xMax);
}

CmOnewayPower::CmOnewayPower(const CmCmndPowerGFF& design, int r, double ssMeans, double target,
                             bool xIsReplicates)
    : mDesign(design), mR(r), mSS(ssMeans), mXIsReplicates(xIsReplicates) {
  mTarget = target;
  mIntegerValued = xIsReplicates;
}

double CmOnewayPower::operator()(double x) {
  double p;
  if (mXIsReplicates) {
    const int k = mSampleSizeFromDouble(x);
    p = k < 1 ? kMissing : mDesign.mPowerAt(k, mSS);
  } else {
    p = mDesign.mPowerAt(mR, x);
  }
  return isNumber(p) ? p - mTarget : kMissing;
}

}  // namespace qel
