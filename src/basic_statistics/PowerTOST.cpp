// Equivalence tests by two one-sided tests (Schuirmann, J. Pharmacokin.
// Biopharm. 15 (1987) 657-680). The two-sided power is the usual
// noncentral-t approximation T(-t; df, b) - T(t; df, a) (Phillips, J.
// Pharmacokin. Biopharm. 18 (1990) 137-144), clamped at 0; it lies below
// the exact power by Owen's Q integral, by more at small df.
//
// The difference solves search the left half of the interval, where the
// power rises from the lower limit to its peak at the centre, and mirror
// each root in the centre. The sample-size solves find the smallest whole n
// whose power reaches the target by doubling from a normal-approximation
// start and halving the bracket on whole numbers; 999999 marks a target no
// n up to 999999 reaches and -1 a failed solve.
#include "basic_statistics/PowerTOST.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>

#include "proxies/SortTool.h"
#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"

namespace qel {

namespace {

const double kMissing = mGetMissingValueCode();
const int kMaxN = 999999;
const double kFuzz = 1e-10;

bool isNumber(double x) {
  return std::isfinite(x) && !mIsNumericMissing(x);
}

bool reaches(double power, double target) {
  return isNumber(power) && (power > target || mEqualWithinFuzz(power, target, kFuzz));
}

double upperNormalQuantile(double p) {
  return mNormalInvCdf(1.0 - p, 0.0, 1.0);
}

// Sorts a list ascending with the position sort and rewrites it in order.
template <typename T>
void sortAscending(std::vector<T>& list) {
  CmSortTool<T> tool;
  tool.mSort(list, true, true);
  std::vector<T> sorted;
  sorted.reserve(list.size());
  for (int i : tool.mGetSortedPositions()) sorted.push_back(list[static_cast<std::size_t>(i)]);
  list.swap(sorted);
}

// The root of f on [a, b] (f(a) < 0 <= f(b), both known) by the
// Anderson-Bjorck variant of false position (Anderson and Bjorck, BIT 13
// (1973) 253-264), which converges superlinearly where the Illinois variant
// needs about four times the evaluations on these smooth power curves.
// Missing values of f end the search with the missing value.
double andersonBjorck(CmRealFunction& f, double a, double fa, double b, double fb) {
  for (int k = 0; k < 200; ++k) {
    const double c = b - fb * (b - a) / (fb - fa);
    if (!(c > std::min(a, b) && c < std::max(a, b))) return std::fabs(fa) < std::fabs(fb) ? a : b;
    const double fc = f(c);
    if (!isNumber(fc)) return kMissing;
    if (fc == 0.0 || std::fabs(fc) <= 1e-13 * (1.0 + std::fabs(f.mTarget)) ||
        std::fabs(b - a) <= 1e-13 * (1.0 + std::fabs(c))) {
      return c;
    }
    if ((fc < 0.0) != (fb < 0.0)) {
      a = b;
      fa = fb;
    } else {
      const double m = 1.0 - fc / fb;
      fa *= m > 0.0 ? m : 0.5;
    }
    b = c;
    fb = fc;
  }
  return b;
}

}  // namespace

CmCmndPowerTOST::CmCmndPowerTOST()
    : mTestType(kTOSTTwoSample),
      mRatio(false),
      mUnused(false),
      mNoncentralityFromN(false),
      mLowerLimit(kMissing),
      mUpperLimit(kMissing),
      mReference(kMissing),
      mPowerAtCenter(0.0),
      mUserLower(kMissing),
      mUserUpper(kMissing) {
  // The flag is rederived by each mComputeAndStore; until then the solvers
  // follow the test type alone.
  mOneSample = false;
}

CmCmndPowerTOST::~CmCmndPowerTOST() = default;

void CmCmndPowerTOST::mSetLimits(double lower, double upper) {
  mUserLower = lower;
  mUserUpper = upper;
  mLowerLimit = mToWorking(lower);
  mUpperLimit = mToWorking(upper);
}

// A ratio at or below zero (or missing) has no logarithm: missing.
double CmCmndPowerTOST::mToWorking(double x) const {
  if (!mRatio || mIsNumericMissing(x)) return x;
  return x > 0.0 && std::isfinite(x) ? std::log(x) : kMissing;
}

double CmCmndPowerTOST::mToUser(double x) const {
  if (!mRatio || !isNumber(x)) return x;
  return x < 700.0 ? std::exp(x) : kMissing;
}

bool CmCmndPowerTOST::mLimitsUsable() const {
  if (mAlternative < 0) return isNumber(mUpperLimit);
  if (mAlternative > 0) return isNumber(mLowerLimit);
  return isNumber(mLowerLimit) && isNumber(mUpperLimit) && mLowerLimit < mUpperLimit;
}

std::vector<double> CmCmndPowerTOST::mGetLambda(int n, double difference, double sigma,
                                                bool oneSample, double lower, double upper,
                                                ETOSTTestType type, EAlternative alternative) {
  const double c = type == kTOSTTwoSample && !oneSample ? 2.0 : 1.0;
  const double w = n > 0 ? std::sqrt(c / n) * sigma : kMissing;
  if (!isNumber(w) || !(w > 0.0) || !isNumber(difference)) {
    return std::vector<double>(alternative == 0 ? 2 : 1, kMissing);
  }
  if (alternative < 0) return {(difference - upper) / w};
  if (alternative > 0) return {(difference - lower) / w};
  return {(difference - lower) / w, (difference - upper) / w};
}

double CmCmndPowerTOST::mTOSTPower(int n, double difference, double /*target*/, double level,
                                   double sigma, bool /*ratio*/, bool, bool oneSample,
                                   bool /*noncentralityFromN*/, double lower, double upper,
                                   ETOSTTestType type, EAlternative alternative) {
  if (!isNumber(sigma) || mEqualWithinFuzz(sigma, 0.0, kFuzz) || sigma < 0.0) return kMissing;
  if (!(level > 0.0 && level < 1.0) || n < 2) return kMissing;
  const std::vector<double> lambda =
      mGetLambda(n, difference, sigma, oneSample, lower, upper, type, alternative);
  for (double l : lambda) {
    if (!isNumber(l)) return kMissing;
  }
  if (alternative != 0) {
    // A one-sided t test against its limit, with the noncentrality given.
    const bool twoSample = type == kTOSTTwoSample && !oneSample;
    const double effect = alternative < 0 ? difference - upper : difference - lower;
    return mTOneCalcOnePower(alternative, n, effect, sigma, level, !twoSample, true, lambda[0]);
  }
  const double df = type == kTOSTTwoSample ? 2.0 * n - 2.0 : n - 1.0;
  const double t = mTInvCdf(1.0 - level, df, 0.0);
  if (!isNumber(t)) return kMissing;
  const double q1 = mTCdf(-t, df, lambda[1], false);
  const double q2 = mTCdf(t, df, lambda[0], false);
  if (!isNumber(q1) || !isNumber(q2)) return kMissing;
  return q1 > q2 ? q1 - q2 : 0.0;
}

double CmCmndPowerTOST::mCalcTOSTPower(double difference, int n) const {
  return mTOSTPower(n, difference, 0.0, mLevel, mSigma, mRatio, mUnused, mOneSample,
                    mNoncentralityFromN, mLowerLimit, mUpperLimit, mTestType, mAlternative);
}

CmTOSTPower::CmTOSTPower(const CmCmndPowerTOST& command, int n, double difference, double target,
                         bool solveForSampleSize)
    : CmPowerFunction(target, solveForSampleSize),
      mCommand(command),
      mN(n),
      mDifference(difference) {}

double CmTOSTPower::mPowerAt(double x) const {
  if (!mSolveForSampleSize) return mCommand.mCalcTOSTPower(x, mN);
  const int n = mSampleSizeFromDouble(x);
  return n < 0 ? kMissing : mCommand.mCalcTOSTPower(mDifference, n);
}

// One-sided: the distance from the limit reached with power p is that of a
// one-sided t test; alternative -1 is solved as +1 and measured down from
// the upper limit.
double CmCmndPowerTOST::mComputeXForPowerAndSampleSize(double power, int n) {
  if (!mLimitsUsable() || !(mSigma > 0.0)) return kMissing;
  const bool twoSample = mTestType == kTOSTTwoSample && !mOneSample;
  const double d = mTComputeXForPowerAndSampleSize(power, n, mSigma, kAlternativeGreater, mLevel,
                                                   !twoSample, true);
  if (!isNumber(d)) return kMissing;
  return mToUser(mAlternative < 0 ? mUpperLimit - d : d + mLowerLimit);
}

double CmCmndPowerTOST::mCalcMeansDifferencesRootUtility(double start, int n, double power) {
  return mSolveLeftHalf(start, kMissing, (mLowerLimit + mUpperLimit) / 2.0, n, power);
}

// The root between start and end (end at most the centre), where the power
// rises from below the target to at least it.
// The power at start may be passed (the missing value when not known); the
// power at the centre is the stored one.
double CmCmndPowerTOST::mSolveLeftHalf(double start, double startPower, double end, int n,
                                       double power) {
  const double centre = (mLowerLimit + mUpperLimit) / 2.0;
  CmTOSTPower f(*this, n, 0.0, power, false);
  double lo = start, hi = std::min(end, centre);
  // A power of 1 at the centre makes the function flat at the bracket end:
  // pull the end in towards the start while it is still flat.
  if (hi == centre && mEqualWithinFuzz(mPowerAtCenter, 1.0, kFuzz)) {
    for (int k = 0; k < 6; ++k) {
      const double next = lo + (hi - lo) / 10.0;
      const double p = mCalcTOSTPower(next, n);
      if (!reaches(p, power)) break;  // keep the end on the target's side
      hi = next;
      if (!mEqualWithinFuzz(p, 1.0, kFuzz)) break;
    }
  }
  double fLo = isNumber(startPower) ? startPower - power : f(lo);
  double fHi = hi == centre && isNumber(mPowerAtCenter) ? mPowerAtCenter - power : f(hi);
  if (!isNumber(fHi) || fHi < 0.0) {
    // The end does not reach the target: widen to the centre.
    hi = centre;
    fHi = isNumber(mPowerAtCenter) ? mPowerAtCenter - power : f(hi);
  }
  if (!isNumber(fLo) || !isNumber(fHi) || fHi < 0.0) return kMissing;
  if (fLo >= 0.0) return lo;
  return andersonBjorck(f, lo, fLo, hi, fHi);
}

double CmCmndPowerTOST::mCalcTOSTMeansDifference(double power, int n) {
  if (mAlternative != 0) return mToWorking(mComputeXForPowerAndSampleSize(power, n));
  if (!mLimitsUsable()) return kMissing;
  const double centre = (mLowerLimit + mUpperLimit) / 2.0;
  mPowerAtCenter = mCalcTOSTPower(centre, n);
  if (!reaches(mPowerAtCenter, power)) return kMissing;  // above the peak
  const double atLower = mCalcTOSTPower(mLowerLimit, n);
  if (reaches(atLower, power)) return mLowerLimit;
  return mSolveLeftHalf(mLowerLimit, atLower, centre, n, power);
}

void CmCmndPowerTOST::mStoreDifferencePair(int& row, int n, double d, double target) {
  if (!isNumber(d)) {
    mEffectList.push_back(kMissing);
    mStoreRow(row++, n, kMissing, target, target);
    return;
  }
  for (double x : {d, mGetSymmetricDifference(d, n, target)}) {
    mEffectList.push_back(mToUser(x));
    mStoreRow(row++, n, mToUser(x), target, target);
  }
}

void CmCmndPowerTOST::mCalculateMeansDifferences() {
  int row = 1;
  mEffectList.clear();
  if (mAlternative != 0) {
    for (int n : mSampleSizeList) {
      for (double p : mPowerList) {
        const double e = mComputeXForPowerAndSampleSize(p, n);
        mEffectList.push_back(e);
        mStoreRow(row++, n, e, p, p);
      }
    }
    return;
  }
  if (mSampleSizeList.size() == 1 && mPowerList.size() == 1) {
    const int n = mSampleSizeList[0];
    mStoreDifferencePair(row, n, mCalcTOSTMeansDifference(mPowerList[0], n), mPowerList[0]);
    return;
  }
  sortAscending(mSampleSizeList);
  sortAscending(mPowerList);
  // The smallest power at the largest n is the easiest target: if even it
  // fails, every pair fails.
  if (mSampleSizeList.empty() || mPowerList.empty()) return;
  const double first = mCalcTOSTMeansDifference(mPowerList.front(), mSampleSizeList.back());
  std::vector<double> previousRoots(mPowerList.size(), kMissing);
  for (int n : mSampleSizeList) {
    if (!isNumber(first)) {
      for (double p : mPowerList) mStoreDifferencePair(row, n, kMissing, p);
      continue;
    }
    mPowerAtCenter = mCalcTOSTPower((mLowerLimit + mUpperLimit) / 2.0, n);
    const double atLower = mCalcTOSTPower(mLowerLimit, n);
    double start = mLowerLimit, startPower = atLower;
    bool beyondPeak = false;
    for (std::size_t k = 0; k < mPowerList.size(); ++k) {
      const double p = mPowerList[k];
      beyondPeak = beyondPeak || !reaches(mPowerAtCenter, p);
      double d = kMissing;
      if (!beyondPeak) {
        // A larger power lies closer to the centre, so the last root is a
        // left end for the next search; a larger n reaches a power farther
        // from the centre, so the root of the same power at the previous
        // (smaller) n is a right end.
        const double end = isNumber(previousRoots[k]) ? previousRoots[k] : HUGE_VAL;
        d = reaches(atLower, p) ? mLowerLimit : mSolveLeftHalf(start, startPower, end, n, p);
        if (isNumber(d)) {
          start = d;
          startPower = p;  // the root's power is the target, to the solve's tolerance
        }
      }
      previousRoots[k] = d;
      mStoreDifferencePair(row, n, d, p);
    }
  }
}

int CmCmndPowerTOST::mCalcSampleSizeRootUtility(double d, double p, int lowest) {
  lowest = std::max(lowest, 1);
  // Normal-approximation start: k / (distance to the nearer limit)^2.
  const double z = upperNormalQuantile(mLevel) + upperNormalQuantile(p);
  const double k = 2.0 * mSigma * mSigma * z * z;
  const double a =
      mEqualWithinFuzz(d, mLowerLimit, kFuzz) ? 1e-6 : (mLowerLimit - d) * (mLowerLimit - d);
  const double b =
      mEqualWithinFuzz(d, mUpperLimit, kFuzz) ? 1e-6 : (mUpperLimit - d) * (mUpperLimit - d);
  double guess = std::max(k / a, k / b);
  if (!isNumber(guess)) guess = kMaxN;
  int hi = static_cast<int>(std::min(static_cast<double>(kMaxN), guess));
  if (hi <= lowest) hi = lowest + 1;
  if (hi > kMaxN) {
    mPowersFound.push_back(mCalcTOSTPower(d, kMaxN));
    return kMaxN;
  }
  // Doubling until the target is reached, then halving the bracket
  // (lo, hi] on whole numbers: the smallest n above lowest reaching p.
  int lo = lowest;
  double power = mCalcTOSTPower(d, hi);
  while (!reaches(power, p)) {
    if (hi == kMaxN) {
      mPowersFound.push_back(power);
      return isNumber(power) ? kMaxN : -1;
    }
    lo = hi;
    hi = static_cast<int>(std::min<long>(2L * hi, kMaxN));
    power = mCalcTOSTPower(d, hi);
  }
  while (hi - lo > 1) {
    const int mid = lo + (hi - lo) / 2;
    const double q = mCalcTOSTPower(d, mid);
    if (reaches(q, p)) {
      hi = mid;
      power = q;
    } else {
      lo = mid;
    }
  }
  mPowersFound.push_back(power);
  return hi;
}

int CmCmndPowerTOST::mCalcTOSTSampleSize(double d, double p) {
  const double at2 = mCalcTOSTPower(d, 2);
  if (!isNumber(at2)) {
    mPowersFound.push_back(kMissing);
    return -1;
  }
  if (reaches(at2, p)) {
    mPowersFound.push_back(at2);
    return 2;
  }
  return mCalcSampleSizeRootUtility(d, p, 2);
}

int CmCmndPowerTOST::mCalculateSampleSizeForOneSidedTest(double d, double p) {
  // d is the distance from the limit, in the direction of the alternative.
  const bool twoSample = mTestType == kTOSTTwoSample && !mOneSample;
  int n = mTCalcSampleSizeGivenPower(kAlternativeGreater, p, d, mSigma, mLevel, !twoSample, true,
                                     false);
  if (n > kMaxN) n = kMaxN;
  double power = kMissing;
  if (n > 0) {
    const double diff = mAlternative < 0 ? mUpperLimit - d : mLowerLimit + d;
    power = mCalcTOSTPower(diff, n);
  }
  mPowersFound.push_back(power);
  return n;
}

void CmCmndPowerTOST::mCalculateSampleSizes() {
  int row = 1;
  mSampleSizeList.clear();
  const bool usable = mLimitsUsable() && mSigma > 0.0;
  auto store = [&](int n, double e, double p) {
    mSampleSizeList.push_back(n);
    mStoreRow(row++, n, e, mPowersFound.empty() ? kMissing : mPowersFound.back(), p);
  };
  if (mAlternative != 0) {
    for (double e : mEffectList) {
      for (double p : mPowerList) {
        const double w = mToWorking(e);
        const double dist = mAlternative < 0 ? mUpperLimit - w : w - mLowerLimit;
        if (!usable || !isNumber(dist)) {
          mPowersFound.push_back(kMissing);
          store(-1, e, p);
        } else {
          store(mCalculateSampleSizeForOneSidedTest(dist, p), e, p);
        }
      }
    }
    return;
  }
  if (mEffectList.size() == 1 && mPowerList.size() == 1) {
    const double w = mToWorking(mEffectList[0]);
    const int n = usable && isNumber(w) ? mCalcTOSTSampleSize(w, mPowerList[0]) : -1;
    if (!usable || !isNumber(w)) mPowersFound.push_back(kMissing);
    mSampleSizeList.push_back(n);
    mStoreRow(row++, n, mEffectList[0], mPowersFound.front(), mPowerList[0]);
    return;
  }
  sortAscending(mEffectList);
  sortAscending(mPowerList);
  if (mEffectList.empty() || mPowerList.empty()) return;
  if (!usable) {
    for (double e : mEffectList) {
      for (double p : mPowerList) {
        mPowersFound.push_back(kMissing);
        store(-1, e, p);
      }
    }
    return;
  }
  // The difference closest to the centre needs the smallest n. It is picked
  // by the truncated distance, the first smallest winning, so that two
  // differences within one unit of the centre tie: kept as it is.
  const double centre = (mLowerLimit + mUpperLimit) / 2.0;
  std::size_t closest = 0;
  double best = 0.0;
  for (std::size_t i = 0; i < mEffectList.size(); ++i) {
    const double w = mToWorking(mEffectList[i]);
    const double dist = isNumber(w) ? std::fabs(std::trunc(centre - w)) : HUGE_VAL;
    if (i == 0 || dist < best) {
      best = dist;
      closest = i;
    }
  }
  const double wClosest = mToWorking(mEffectList[closest]);
  const int n0 = isNumber(wClosest) ? mCalcTOSTSampleSize(wClosest, mPowerList.front()) : -1;
  if (n0 == kMaxN) {
    // No combination can do better than the closest difference.
    const double atMax = mPowersFound.back();
    mPowersFound.pop_back();
    for (double e : mEffectList) {
      for (double p : mPowerList) {
        mPowersFound.push_back(atMax);
        store(kMaxN, e, p);
      }
    }
    return;
  }
  mPowersFound.clear();
  for (double e : mEffectList) {
    const double w = mToWorking(e);
    int previous = 0;
    for (double p : mPowerList) {
      int n;
      if (!isNumber(w)) {
        mPowersFound.push_back(kMissing);
        n = -1;
      } else if (previous == kMaxN) {
        mPowersFound.push_back(mPowersFound.back());
        n = kMaxN;
      } else if (previous < 2) {
        n = mCalcTOSTSampleSize(w, p);
      } else {
        // Powers ascend, so the n of the previous power is a lower bound.
        n = mCalcSampleSizeRootUtility(w, p, previous - 1);
      }
      if (n > 0) previous = n;
      store(n, e, p);
    }
  }
}

bool CmCmndPowerTOST::mComputeAndStore() {
  mOneSample = mAlternative != 0 && (mTestType == kTOSTOneSample || mTestType == kTOSTPaired);
  mLowerLimit = mToWorking(mUserLower);
  mUpperLimit = mToWorking(mUserUpper);
  mPowersFound.clear();
  if (!mEffectsGiven) {
    mCalculateMeansDifferences();
  } else if (!mPowersGiven) {
    int row = 1;
    for (double e : mEffectList) {
      for (int n : mSampleSizeList) {
        const double p = mLimitsUsable() ? mCalcTOSTPower(mToWorking(e), n) : kMissing;
        mPowerList.push_back(p);
        mStoreRow(row++, n, e, p, 0.0);
      }
    }
  } else if (!mSampleSizesGiven) {
    mCalculateSampleSizes();
  }
  return true;
}

int CmCmndPowerTOST::mGetMinSampleSize() const {
  int best = -1;
  auto take = [&](int n) {
    if (n >= 0 && (best < 0 || n < best)) best = n;
  };
  for (int n : mResultSampleSizes) take(n);
  for (int n : mFirstIntegerList) take(n);
  return best;
}

void CmCmndPowerTOST::mGetScaleMinMax(double* /*a*/, double* /*b*/, double& low,
                                      double& high) const {
  low = mAlternative < 0 ? kMissing : mToUser(mLowerLimit);
  high = mAlternative > 0 ? kMissing : mToUser(mUpperLimit);
}

void CmCmndPowerTOST::mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin,
                                            double* xMax) {
  std::vector<double> kept;
  for (double x : data) {
    if (!mIsNumericMissing(x)) kept.push_back(x);
  }
  const int n = mGetMinSampleSize();
  if (mAlternative != 0 && n >= 0) {
    double d = mComputeXForPowerAndSampleSize(0.99, n);
    if (mIsNumericMissing(d)) d = mGetDefaultDiffForSigma(static_cast<unsigned>(n));
    *xMin = d;
    *xMax = d;
  }
  mGetSuggestedDataXMinXMax(kept, xMin, xMax);
  mAdjustForEqualSuggestedMinMax(*xMin, xMax);
}

}  // namespace qel
