// t and z tests of means, and one or two proportions.
#include <algorithm>
#include <cmath>

#include "basic_statistics/Power.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"

namespace qel {

// --- CmCmndPowerTAndZ --------------------------------------------------------

CmCmndPowerTAndZ::CmCmndPowerTAndZ() : mUseT(true), mPaired(false) {}

int CmCmndPowerTAndZ::mSetZTest(bool zTest) {
  mUseT = !zTest;
  return 1;
}

double CmCmndPowerTAndZ::mComputeXForPowerAndSampleSize(double power, int n) {
  return mTComputeXForPowerAndSampleSize(power, n, mSigma, mAlternative, mLevel,
                                         mGetComputeOneSample(), mUseT);
}

bool CmCmndPowerTAndZ::mComputeAndStore() {
  const bool oneSample = mGetComputeOneSample();
  const double missing = mGetMissingValueCode();
  int row = 1;
  if (!mEffectsGiven) {
    for (int n : mSampleSizeList) {
      for (double p : mPowerList) mStoreRow(row++, n, mComputeXForPowerAndSampleSize(p, n), p, 0.0);
    }
  } else if (!mPowersGiven) {
    for (double e : mEffectList) {
      for (int n : mSampleSizeList) {
        const double p =
            mTOneCalcOnePower(mAlternative, n, e, mSigma, mLevel, oneSample, mUseT, missing);
        mStoreRow(row++, n, e, p, 0.0);
      }
    }
  } else if (!mSampleSizesGiven) {
    for (double e : mEffectList) {
      for (double p : mPowerList) {
        // The search end follows the design actually computed: a paired test
        // takes the one-sample end here.
        const int n =
            mTCalcSampleSizeGivenPower(mAlternative, p, e, mSigma, mLevel, oneSample, mUseT, false);
        const double q =
            n > 0 ? mTOneCalcOnePower(mAlternative, n, e, mSigma, mLevel, oneSample, mUseT, missing)
                  : missing;
        mStoreRow(row++, n, e, q, p);
      }
    }
  }
  return true;
}

void CmCmndPowerTAndZ::mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin,
                                             double* xMax) {
  const int n = mGetMinN();
  double d = mComputeXForPowerAndSampleSize(mGetHighPower(), n);
  d = mIsNumericMissing(d) ? mGetDefaultDiffForSigma(static_cast<unsigned>(n)) : std::fabs(d);
  if (mAlternative < 0) {
    *xMin = -d;
    *xMax = 0.0;
  } else if (mAlternative > 0) {
    *xMin = 0.0;
    *xMax = d;
  } else {
    *xMin = -d;
    *xMax = d;
  }
  mGetSuggestedDataXMinXMax(data, xMin, xMax);
  mAdjustForEqualSuggestedMinMax(*xMin, xMax);
}

// --- CmCmndPowerProportion ---------------------------------------------------

CmCmndPowerProportion::CmCmndPowerProportion() : mNull(mGetMissingValueCode()) {}

double CmCmndPowerProportion::mCritical() const {
  if (!(mLevel > 0.0 && mLevel < 1.0)) return mGetMissingValueCode();
  return mNormalCritValue(mLevel, mAlternative);
}

double CmCmndPowerProportion::mComputeXForPowerAndSampleSize(double power, int n) {
  return mComputePOneXForPowerAndSampleSize(mAlternative, power, n, mCritical(), mNull, mOneSample);
}

double CmCmndPowerProportion::mComputeOtherXForPowerAndSampleSize(double power, int n) {
  return mComputePOneOtherXForPowerAndSampleSize(power, n, mCritical(), mNull, mOneSample);
}

bool CmCmndPowerProportion::mComputeAndStore() {
  const double c = mCritical();
  const double missing = mGetMissingValueCode();
  int row = 1;
  if (!mEffectsGiven) {
    // With the null at 0.5 the two roots of the two-sided alternative are
    // mirror images: only one is given.
    const bool both = mAlternative == kAlternativeNotEqual && mNull != 0.5;
    for (int n : mSampleSizeList) {
      for (double p : mPowerList) {
        mStoreRow(row++, n, mComputeXForPowerAndSampleSize(p, n), p, 0.0);
        if (both) mStoreRow(row++, n, mComputeOtherXForPowerAndSampleSize(p, n), p, 0.0);
      }
    }
  } else if (!mPowersGiven) {
    for (double e : mEffectList) {
      for (int n : mSampleSizeList) {
        const double p = mPOneCalcOnePower(mAlternative, n, c, e, mNull, mOneSample);
        mStoreRow(row++, n, mAddBase(e, mNull), p, 0.0);
      }
    }
  } else if (!mSampleSizesGiven) {
    for (double e : mEffectList) {
      for (double p : mPowerList) {
        const int n = mCalcPOneSampleSizeGivenPower(mAlternative, p, e, c, mNull, mOneSample);
        const double q =
            n > 0 ? mPOneCalcOnePower(mAlternative, n, c, e, mNull, mOneSample) : missing;
        mStoreRow(row++, n, mAddBase(e, mNull), q, p);
      }
    }
  }
  return true;
}

void CmCmndPowerProportion::mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin,
                                                  double* xMax) {
  const int n = mGetMinN();
  const double power = mGetHighPower();
  // Effects are proportions: the fallback ends -null and 1 - null from the
  // null are the proportions 0 and 1.
  const double lowEnd = 0.0, highEnd = 1.0;
  const bool hasNull = mNull >= 0.0 && mNull <= 1.0;
  double low = hasNull ? mNull : lowEnd, high = hasNull ? mNull : highEnd;
  if (mAlternative > 0) {
    high = mComputeXForPowerAndSampleSize(power, n);
    if (mIsNumericMissing(high)) high = highEnd;
  } else if (mAlternative < 0) {
    low = mComputeXForPowerAndSampleSize(power, n);
    if (mIsNumericMissing(low)) low = lowEnd;
  } else {
    high = mComputeXForPowerAndSampleSize(power, n);
    if (mIsNumericMissing(high)) high = highEnd;
    low = mComputeOtherXForPowerAndSampleSize(power, n);
    if (mIsNumericMissing(low)) low = lowEnd;
  }
  *xMin = low;
  *xMax = high;
  mGetSuggestedDataXMinXMax(data, xMin, xMax);
  if (mEqualWithinFuzz(*xMin, *xMax, 0.0)) {
    *xMax = std::min(*xMin + std::max(std::fabs(*xMin) * 0.1, 0.1), 1.0);
  }
}

}  // namespace qel
