// Power and sample-size commands.
//
// A command answers one request: given two of sample size, effect and power,
// find the third, over the cross product of the two given lists. The host
// builds the command, sets the design parameters and the two given lists,
// optionally lends storage columns, and calls mComputeAndStore once. Every
// computed row is appended to the result vectors and, when storage columns
// are lent, written into them at the row's index.
//
// Which quantity is solved (checked in this order by every design):
//   1. effects not given: the effect from each pair of sample size and power;
//   2. powers not given: the power from each pair of effect and sample size;
//   3. sample sizes not given: the smallest whole sample size from each pair
//      of effect and target power; the row shows the power that size reaches;
//   4. all three given: nothing is computed.
// A value that cannot be computed is the missing value in its row; a failed
// sample-size solve is -1 in the result vector and the missing value in a
// storage column. mIsExactlyTwoSubcommands, mGeneralErrorChecking and
// mIsEffectLegal are the request checks a host runs first.
//
// Writing a new design: derive from CmCmndPower, give it a virtual
// mComputeAndStore that follows the rule above and emits each row through
// mStoreRow(row, n, effect, power, target), rows numbered from 1 in loop
// order; use mGetMinN, mGetSuggestedDataXMinXMax, mAdjustForEqualSuggestedMinMax
// and mProcessXMinMax for the extents of a power curve.
#ifndef QEL_SRC_BASIC_STATISTICS_POWER_H
#define QEL_SRC_BASIC_STATISTICS_POWER_H

#include <qel/basic_types.h>

#include <memory>
#include <vector>

#include "basic_statistics/PowerUtilities.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {

class CmCmndPower {
 public:
  CmCmndPower();
  CmCmndPower(const CmCmndPower&) = delete;
  CmCmndPower& operator=(const CmCmndPower&) = delete;
  virtual ~CmCmndPower();

  // Design parameters.
  void mSetSigma(double sigma) { mSigma = sigma; }
  void mSetLevel(double level) { mLevel = level; }
  void mSetAlternative(EAlternative alternative) { mAlternative = alternative; }
  void mSetTwoSample(bool twoSample) { mOneSample = !twoSample; }

  // Host columns, written by index (row k to element k - 1) and never
  // resized or freed; a null pointer lends nothing.
  void mSetStorageSample(std::vector<double>* storage) { mStorageSample = storage; }
  void mSetStorageEffect(std::vector<double>* storage) { mStorageEffect = storage; }
  void mSetStoragePower(std::vector<double>* storage) { mStoragePower = storage; }

  // The given lists: each list setter also marks the list as given.
  void mSetSampleSizes(const std::vector<int>& sizes);
  void mSetEffects(const std::vector<double>& effects);
  void mSetPowers(const std::vector<double>& powers);
  void mSetSampleSizesGiven(bool given) { mSampleSizesGiven = given; }
  void mSetEffectsGiven(bool given) { mEffectsGiven = given; }
  void mSetPowersGiven(bool given) { mPowersGiven = given; }
  // Design lists of the factorial designs; the first also enters mGetMinN.
  void mSetFirstIntegerList(const std::vector<int>& list) { mFirstIntegerList = list; }
  void mSetSecondIntegerList(const std::vector<int>& list) { mSecondIntegerList = list; }
  // Fixed ends of the display range of a power curve.
  void mSetMinimum(double minimum);
  void mSetMaximum(double maximum);

  bool mIsSampleSizesGiven() const { return mSampleSizesGiven; }
  bool mIsEffectsGiven() const { return mEffectsGiven; }
  bool mIsPowersGiven() const { return mPowersGiven; }
  std::vector<double>& mGetEffect() { return mEffectList; }
  const std::vector<int>& mGetResultSampleSizes() const { return mResultSampleSizes; }
  const std::vector<double>& mGetResultEffects() const { return mResultEffects; }
  const std::vector<double>& mGetResultPowers() const { return mResultPowers; }
  const std::vector<double>& mGetTargetPowers() const { return mTargetPowers; }

  // Request checks.
  bool mIsExactlyTwoSubcommands() const;
  // Every given power lies above the level (true when powers are not given).
  bool mGeneralErrorChecking() const;
  // The same loop over the power list, whatever the flag and the argument.
  bool mIsPowerPossible(EAlternative alternative) const;
  // base + e strictly inside (low, high) for every effect e; a missing end
  // is no limit. The first violation calls mDisplayEffectError.
  bool mIsEffectLegal(double base, double low, double high);
  virtual void mDisplayEffectError() const;

  int mGetNumberOfPossibleSolnEffect() const;
  double mGetHighPower() const;
  // The smaller of the smallest result sample size and the smallest entry of
  // the first integer list (each mGetMaxInteger() when empty).
  int mGetMinN() const;
  double mGetDefaultDiffForSigma(unsigned n) const;

  // Extents of a power curve.
  void mGetSuggestedDataXMinXMax(const std::vector<double>& data, double* xMin, double* xMax) const;
  void mAdjustForEqualSuggestedMinMax(double xMin, double* xMax) const;
  void mProcessXMinMax(double dataMin, double dataMax, double absoluteMin, double absoluteMax,
                       double& xMin, double& xMax) const;

 protected:
  // Appends a row to the result vectors (the target only when sample sizes
  // are solved) and writes it into the lent columns at index row - 1.
  void mStoreRow(int row, int sample, double effect, double power, double targetPower);
  // x + base, or the missing value when x is missing: an effect as stored.
  static double mAddBase(double x, double base) { return mIsNumericMissing(x) ? x : x + base; }

  bool mOneSample;
  EAlternative mAlternative;
  bool mSampleSizesGiven;
  bool mPowersGiven;
  bool mEffectsGiven;
  double mLevel;
  double mSigma;
  std::vector<double>* mStorageSample;
  std::vector<double>* mStorageEffect;
  std::vector<double>* mStoragePower;
  // Scratch columns a design may own; freed with the command.
  std::unique_ptr<std::vector<double>> mOwnedVectors[2];
  bool mReserved;
  std::vector<int> mFirstIntegerList;
  std::vector<int> mSecondIntegerList;
  std::vector<int> mSampleSizeList;
  std::vector<double> mEffectList;
  std::vector<double> mPowerList;
  std::vector<int> mResultSampleSizes;
  std::vector<double> mResultEffects;
  std::vector<double> mResultPowers;
  std::vector<double> mTargetPowers;
  bool mMinimumGiven;
  bool mMaximumGiven;
  double mMinimum;
  double mMaximum;
};

// Designs with one power function of (n, effect): the effect is searched on
// each side the alternative allows, the sample size upward from a start.
class CmCmndPowerBasic : public CmCmndPower {
 public:
  CmCmndPowerBasic();
  ~CmCmndPowerBasic() override;

  virtual bool mComputeAndStore();
  virtual double mGetPower(unsigned n, double effect) const = 0;
  virtual double mComputeXForPowerAndSampleSize(double power, int n, bool positive) const = 0;
  virtual int mComputeXForPowerAndEffect(double power, double effect) const = 0;
  virtual void mInitializeSuggestedMinMax(double* xMin, double* xMax) const;
  virtual double mGetMinForMissing() const = 0;
  virtual double mGetMaxForMissing() const = 0;

  // The three loops of mComputeAndStore; each returns the next row number.
  int mCalculateEffect(int row);
  int mCalculatePower(int row);
  int mCalculateSampleSize(int row);

  // Solution k of an effect search is on the positive side: always for the
  // upper alternative, never for the lower one, the first of two otherwise.
  bool mSetPositiveNegativeEffect(int k) const;

  // The curve's x range: the effects at power 0.99 with mGetMinN() on each
  // side the alternative allows, widened to hold data.
  void mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin, double* xMax) const;

  void mSetBaseValue(double base) { mBaseValue = base; }
  double mGetBaseValue() const { return mBaseValue; }

 protected:
  // Added to an effect of the list when it is stored.
  double mBaseValue;
};

// Variances: the effect is the ratio of the variances (or standard
// deviations) of the population to the hypothesised one, or of two samples.
class CmCmndVariance : public CmCmndPowerBasic {
 public:
  CmCmndVariance();
  double mGetPower(unsigned n, double effect) const override;
  double mComputeXForPowerAndSampleSize(double power, int n, bool positive) const override;
  int mComputeXForPowerAndEffect(double power, double effect) const override;
  void mInitializeSuggestedMinMax(double* xMin, double* xMax) const override;
  double mGetMinForMissing() const override;
  double mGetMaxForMissing() const override;

  void mSetRatioOfSigmas(bool ratioOfSigmas) { mRatioOfSigmas = ratioOfSigmas; }
  void mSetTestMethod(ETestMethod method) { mMethod = method; }
  void mSetKurtosis(double kurtosis) { mKurtosis = kurtosis; }

 protected:
  bool mRatioOfSigmas;
  ETestMethod mMethod;
  double mKurtosis;
};

// Poisson rates: the effect list holds differences from the baseline rate;
// stored effects are comparison rates (the rate is the base value).
class CmCmndPowerPoisson : public CmCmndPowerBasic {
 public:
  CmCmndPowerPoisson();
  double mGetPower(unsigned n, double effect) const override;
  double mComputeXForPowerAndSampleSize(double power, int n, bool positive) const override;
  int mComputeXForPowerAndEffect(double power, double effect) const override;
  void mInitializeSuggestedMinMax(double* xMin, double* xMax) const override;
  double mGetMinForMissing() const override;
  double mGetMaxForMissing() const override;

  void mSetRate(double rate);
  void mSetLengths(const std::vector<double>& lengths) { mLengths = lengths; }
  // The lengths of observation in use: 1.0 when none is given; a single
  // length serves both samples of a two-sample design.
  void mGetLength(std::vector<double>& lengths) const;

 protected:
  std::vector<double> mLengths;
  double mRate;
};

// One proportion against the null, or two proportions. Effects are
// differences from the null; stored effects are comparison proportions.
class CmCmndPowerProportion : public CmCmndPower {
 public:
  CmCmndPowerProportion();
  virtual bool mComputeAndStore();
  // The comparison proportion reaching power with n (for the two-sided
  // alternative the root above the null), and the root below the null.
  virtual double mComputeXForPowerAndSampleSize(double power, int n);
  virtual double mComputeOtherXForPowerAndSampleSize(double power, int n);

  void mSetNull(double null) { mNull = null; }
  void mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin, double* xMax);

 protected:
  double mCritical() const;
  double mNull;
};

// t and z tests of one mean, of paired differences or of two means (n per
// sample, common sigma).
class CmCmndPowerTAndZ : public CmCmndPower {
 public:
  CmCmndPowerTAndZ();
  virtual bool mComputeAndStore();
  virtual double mComputeXForPowerAndSampleSize(double power, int n);

  // Stores the negation of zTest; returns 1.
  int mSetZTest(bool zTest);
  void mSetPair(bool paired) { mPaired = paired; }
  // A paired test is a one-sample test of the differences.
  bool mGetComputeOneSample() const { return mPaired || mOneSample; }
  void mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin, double* xMax);

 protected:
  bool mUseT;
  bool mPaired;
};

}  // namespace qel

#endif
