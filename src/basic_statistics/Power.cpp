// The command base of the power and sample-size designs: the lists and
// flags of a request, the request checks, row storage and the extents of a
// power curve.
#include "basic_statistics/Power.h"

#include <algorithm>
#include <cmath>

#include "proxies/rows.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"

namespace qel {

namespace {

// The larger of x and a limit; a missing limit is no limit.
double atLeast(double x, double limit) {
  return mIsNumericMissing(limit) ? x : std::max(x, limit);
}

double atMost(double x, double limit) {
  return mIsNumericMissing(limit) ? x : std::min(x, limit);
}

// Writes one value at index into a lent column; a column too short for the
// row is left alone rather than written past its end.
void writeAt(std::vector<double>* storage, int row, double value) {
  if (storage == nullptr || row < 1) return;
  const auto index = static_cast<std::size_t>(row - 1);
  if (index < storage->size()) (*storage)[index] = value;
}

}  // namespace

CmCmndPower::CmCmndPower()
    : mOneSample(true),
      mAlternative(kAlternativeNotEqual),
      mSampleSizesGiven(false),
      mPowersGiven(false),
      mEffectsGiven(false),
      mLevel(0.05),
      mSigma(1.0),
      mStorageSample(nullptr),
      mStorageEffect(nullptr),
      mStoragePower(nullptr),
      mReserved(false),
      mMinimumGiven(false),
      mMaximumGiven(false),
      mMinimum(0.0),
      mMaximum(0.0) {}

CmCmndPower::~CmCmndPower() = default;

void CmCmndPower::mSetSampleSizes(const std::vector<int>& sizes) {
  mSampleSizeList = sizes;
  mSampleSizesGiven = true;
}

void CmCmndPower::mSetEffects(const std::vector<double>& effects) {
  mEffectList = effects;
  mEffectsGiven = true;
}

void CmCmndPower::mSetPowers(const std::vector<double>& powers) {
  mPowerList = powers;
  mPowersGiven = true;
}

void CmCmndPower::mSetMinimum(double minimum) {
  mMinimum = minimum;
  mMinimumGiven = true;
}

void CmCmndPower::mSetMaximum(double maximum) {
  mMaximum = maximum;
  mMaximumGiven = true;
}

bool CmCmndPower::mIsExactlyTwoSubcommands() const {
  return (mSampleSizesGiven ? 1 : 0) + (mPowersGiven ? 1 : 0) + (mEffectsGiven ? 1 : 0) == 2;
}

bool CmCmndPower::mGeneralErrorChecking() const {
  return !mPowersGiven || mIsPowerPossible(mAlternative);
}

bool CmCmndPower::mIsPowerPossible(EAlternative /*alternative*/) const {
  for (double power : mPowerList) {
    if (!(power > mLevel)) return false;
  }
  return true;
}

bool CmCmndPower::mIsEffectLegal(double base, double low, double high) {
  for (double effect : mEffectList) {
    const double x = base + effect;
    const bool aboveLow = mIsNumericMissing(low) || x > low;
    const bool belowHigh = mIsNumericMissing(high) || x < high;
    if (!aboveLow || !belowHigh) {
      mDisplayEffectError();
      return false;
    }
  }
  return true;
}

void CmCmndPower::mDisplayEffectError() const {}

int CmCmndPower::mGetNumberOfPossibleSolnEffect() const {
  return mAlternative == kAlternativeNotEqual ? 2 : 1;
}

double CmCmndPower::mGetHighPower() const {
  return 0.99;
}

int CmCmndPower::mGetMinN() const {
  const int largest = static_cast<int>(mGetMaxInteger());
  int fromResults = largest;
  if (!mResultSampleSizes.empty()) {
    fromResults = *std::min_element(mResultSampleSizes.begin(), mResultSampleSizes.end());
  }
  int fromList = largest;
  if (!mFirstIntegerList.empty()) {
    fromList = *std::min_element(mFirstIntegerList.begin(), mFirstIntegerList.end());
  }
  return std::min(fromResults, fromList);
}

double CmCmndPower::mGetDefaultDiffForSigma(unsigned n) const {
  return 6.0 * mSigma / std::max(n, 1u);
}

void CmCmndPower::mGetSuggestedDataXMinXMax(const std::vector<double>& data, double* xMin,
                                            double* xMax) const {
  if (data.empty()) return;
  CbRows rows;
  rows.mUseAllRows(static_cast<int>(std::min<std::size_t>(data.size(), 2147483647u)));
  double lo = 0.0, hi = 0.0;
  mMinMax(data, rows, &lo, &hi);
  if (mIsNumericMissing(lo)) return;
  *xMin = std::min(lo - (*xMax - *xMin) * 0.015, *xMin);
  *xMax = std::max(hi + (*xMax - *xMin) * 0.015, *xMax);
}

void CmCmndPower::mAdjustForEqualSuggestedMinMax(double xMin, double* xMax) const {
  if (mEqualWithinFuzz(xMin, *xMax, 0.0)) *xMax = xMin + std::max(std::fabs(xMin), 1.0);
}

void CmCmndPower::mProcessXMinMax(double dataMin, double dataMax, double absoluteMin,
                                  double absoluteMax, double& xMin, double& xMax) const {
  if (!mMinimumGiven && !mMaximumGiven) {
    xMin = atLeast(dataMin, absoluteMin);
    xMax = atMost(dataMax, absoluteMax);
  } else if (!mMinimumGiven) {
    xMax = atLeast(atMost(mMaximum, absoluteMax), absoluteMin);
    xMin = xMax < dataMin ? atLeast(xMax - (dataMax - dataMin), absoluteMin) : dataMin;
  } else if (!mMaximumGiven) {
    xMin = atMost(atLeast(mMinimum, absoluteMin), absoluteMax);
    xMax = xMin > dataMax ? atMost(xMin + (dataMax - dataMin), absoluteMax) : dataMax;
  } else {
    xMin = atLeast(mMinimum, absoluteMin);
    xMax = atMost(mMaximum, absoluteMax);
  }
  const bool impossible = (!mIsNumericMissing(absoluteMax) && absoluteMax <= xMin) ||
                          (!mIsNumericMissing(absoluteMin) && absoluteMin >= xMax);
  if (impossible) {
    xMin = dataMin;
    xMax = dataMax;
  }
}

void CmCmndPower::mStoreRow(int row, int sample, double effect, double power, double targetPower) {
  mResultSampleSizes.push_back(sample);
  mResultEffects.push_back(effect);
  mResultPowers.push_back(power);
  if (!mSampleSizesGiven) mTargetPowers.push_back(targetPower);
  writeAt(mStorageSample, row, sample < 0 ? mGetMissingValueCode() : static_cast<double>(sample));
  writeAt(mStorageEffect, row, effect);
  writeAt(mStoragePower, row, power);
}

}  // namespace qel
