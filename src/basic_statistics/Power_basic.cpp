// Designs with a single power function of (n, effect): variances and
// Poisson rates, on the shared loops of CmCmndPowerBasic.
#include <algorithm>
#include <cmath>

#include "basic_statistics/Power.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {

// --- CmCmndPowerBasic --------------------------------------------------------

CmCmndPowerBasic::CmCmndPowerBasic() : mBaseValue(0.0) {}

CmCmndPowerBasic::~CmCmndPowerBasic() = default;

bool CmCmndPowerBasic::mComputeAndStore() {
  if (!mEffectsGiven) {
    mCalculateEffect(1);
  } else if (!mPowersGiven) {
    mCalculatePower(1);
  } else if (!mSampleSizesGiven) {
    mCalculateSampleSize(1);
  }
  return true;
}

bool CmCmndPowerBasic::mSetPositiveNegativeEffect(int k) const {
  if (mAlternative > 0) return true;
  if (mAlternative < 0) return false;
  return k == 0;
}

int CmCmndPowerBasic::mCalculateEffect(int row) {
  const int solutions = mGetNumberOfPossibleSolnEffect();
  for (int n : mSampleSizeList) {
    for (double p : mPowerList) {
      for (int k = 0; k < solutions; ++k) {
        const double e = mComputeXForPowerAndSampleSize(p, n, mSetPositiveNegativeEffect(k));
        mStoreRow(row++, n, e, p, 0.0);
      }
    }
  }
  return row;
}

int CmCmndPowerBasic::mCalculatePower(int row) {
  for (double e : mEffectList) {
    for (int n : mSampleSizeList) {
      const double p = n > 0 ? mGetPower(static_cast<unsigned>(n), e) : mGetMissingValueCode();
      mStoreRow(row++, n, mAddBase(e, mBaseValue), p, 0.0);
    }
  }
  return row;
}

int CmCmndPowerBasic::mCalculateSampleSize(int row) {
  for (double e : mEffectList) {
    for (double p : mPowerList) {
      const int n = mComputeXForPowerAndEffect(p, e);
      const double q = n > 0 ? mGetPower(static_cast<unsigned>(n), e) : mGetMissingValueCode();
      mStoreRow(row++, n, mAddBase(e, mBaseValue), q, p);
    }
  }
  return row;
}

void CmCmndPowerBasic::mInitializeSuggestedMinMax(double* /*xMin*/, double* /*xMax*/) const {}

void CmCmndPowerBasic::mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin,
                                             double* xMax) const {
  *xMin = mGetMaxDataValue();
  *xMax = -*xMin;
  mInitializeSuggestedMinMax(xMin, xMax);
  const int n = mGetMinN();
  const double power = mGetHighPower();
  if (mAlternative <= 0) {
    double e = mComputeXForPowerAndSampleSize(power, n, false);
    if (mIsNumericMissing(e)) e = mGetMinForMissing();
    *xMin = std::min(*xMin, e);
  }
  if (mAlternative >= 0) {
    double e = mComputeXForPowerAndSampleSize(power, n, true);
    if (mIsNumericMissing(e)) e = mGetMaxForMissing();
    *xMax = std::max(*xMax, e);
  }
  mGetSuggestedDataXMinXMax(data, xMin, xMax);
  mAdjustForEqualSuggestedMinMax(*xMin, xMax);
}

// --- CmCmndVariance ----------------------------------------------------------

CmCmndVariance::CmCmndVariance()
    : mRatioOfSigmas(false), mMethod(kVarianceLevene), mKurtosis(0.0) {}

double CmCmndVariance::mGetPower(unsigned n, double effect) const {
  const int m = static_cast<int>(std::min(n, 2147483647u));
  return mVariancePower(mAlternative, m, m, effect, mLevel, mOneSample, mRatioOfSigmas, mMethod,
                        mKurtosis);
}

double CmCmndVariance::mComputeXForPowerAndSampleSize(double power, int n, bool positive) const {
  return mCalcVarEffectGivenPower(mAlternative, power, n, mLevel, mOneSample, mRatioOfSigmas,
                                  mMethod, mKurtosis, positive);
}

int CmCmndVariance::mComputeXForPowerAndEffect(double power, double effect) const {
  return mCalcVarSampleSizeGivenPower(mAlternative, power, effect, mLevel, mOneSample,
                                      mRatioOfSigmas, mMethod, mKurtosis);
}

void CmCmndVariance::mInitializeSuggestedMinMax(double* xMin, double* xMax) const {
  if (mAlternative < 0) *xMax = 1.0;
  if (mAlternative > 0) *xMin = 1.0;
}

double CmCmndVariance::mGetMinForMissing() const {
  return 0.1;
}

double CmCmndVariance::mGetMaxForMissing() const {
  return 10.0;
}

// --- CmCmndPowerPoisson ------------------------------------------------------

CmCmndPowerPoisson::CmCmndPowerPoisson() : mRate(1.0) {
  mBaseValue = mRate;
}

void CmCmndPowerPoisson::mSetRate(double rate) {
  mRate = rate;
  mBaseValue = rate;
}

void CmCmndPowerPoisson::mGetLength(std::vector<double>& lengths) const {
  lengths = mLengths;
  if (lengths.empty()) lengths.push_back(1.0);
  if (!mOneSample && lengths.size() == 1) lengths.push_back(lengths[0]);
}

double CmCmndPowerPoisson::mGetPower(unsigned n, double effect) const {
  std::vector<double> lengths;
  mGetLength(lengths);
  const int m = static_cast<int>(std::min(n, 2147483647u));
  return mPoissonPower(mAlternative, m, mRate, effect, mLevel, lengths, mOneSample);
}

double CmCmndPowerPoisson::mComputeXForPowerAndSampleSize(double power, int n,
                                                          bool positive) const {
  if (!(power > 0.0 && power < 1.0)) return mGetMissingValueCode();
  std::vector<double> lengths;
  mGetLength(lengths);
  CmPoissonPower f(mAlternative, n, mRate, 0.0, mLevel, lengths, mOneSample, power, false);
  double lower = 0.0, upper = 0.0;
  bool rootAtLower = false;
  bool found;
  if (positive) {
    found = mCalculateLowerUpperPos(0.0, std::max(mRate, 10.0), &lower, &upper, &rootAtLower, f,
                                    false, mOneSample);
  } else {
    // Differences down to just above -rate (a comparison rate just above 0).
    lower = -(mRate - mGetEps(false) * mRate);
    upper = 0.0;
    const double atLower = f(lower);
    const double atUpper = f(upper);
    found = !mIsNumericMissing(atLower) && !mIsNumericMissing(atUpper) && atLower > 0.0 &&
            atUpper < 0.0;
  }
  return mAddBase(qel::mGetEffect(found, rootAtLower, lower, upper, f), mRate);
}

int CmCmndPowerPoisson::mComputeXForPowerAndEffect(double power, double effect) const {
  if (!(power > 0.0 && power < 1.0)) return -1;
  std::vector<double> lengths;
  mGetLength(lengths);
  CmPoissonPower f(mAlternative, 0, mRate, effect, mLevel, lengths, mOneSample, power, true);
  double lower = 0.0, upper = 0.0;
  bool rootAtLower = false;
  const bool found =
      mCalculateLowerUpperPos(1.01, 30.0, &lower, &upper, &rootAtLower, f, true, mOneSample);
  return mGetSampleSize(found, rootAtLower, lower, upper, f);
}

void CmCmndPowerPoisson::mInitializeSuggestedMinMax(double* xMin, double* xMax) const {
  if (mAlternative < 0) *xMax = mRate;
  if (mAlternative > 0) *xMin = mRate;
}

// The fallback ends are differences from the rate, taken to comparison rates
// like every other stored effect.
double CmCmndPowerPoisson::mGetMinForMissing() const {
  return mRate + mRate * -0.9;
}

double CmCmndPowerPoisson::mGetMaxForMissing() const {
  return mRate + mRate * 10.0;
}

}  // namespace qel
