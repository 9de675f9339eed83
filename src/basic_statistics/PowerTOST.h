// Power, sample size and difference for equivalence tests by two one-sided
// tests (Schuirmann 1987). The power of the two-sided form is not monotone
// in the difference: it peaks at the centre of the equivalence interval, so
// a target power has two solutions (a difference and its mirror in the
// centre) or none. Ratios of means are handled on the log scale.
#ifndef QEL_SRC_BASIC_STATISTICS_POWERTOST_H
#define QEL_SRC_BASIC_STATISTICS_POWERTOST_H

#include <vector>

#include "basic_statistics/Power.h"
#include "basic_statistics/PowerUtilities.h"

namespace qel {

enum ETOSTTestType : int { kTOSTOneSample = 0, kTOSTPaired = 1, kTOSTTwoSample = 2 };

class CmCmndPowerTOST : public CmCmndPower {
 public:
  CmCmndPowerTOST();
  ~CmCmndPowerTOST() override;

  // The one-sided difference (on the user's scale) whose power with n is p.
  virtual double mComputeXForPowerAndSampleSize(double power, int n);
  virtual bool mComputeAndStore();

  void mSetTestType(ETOSTTestType type) { mTestType = type; }
  // Limits and effects on the user's scale: ratios when the flag is set.
  void mSetRatio(bool ratio) { mRatio = ratio; }
  void mSetLimits(double lower, double upper);
  void mSetNoncentralityFromN(bool flag) { mNoncentralityFromN = flag; }
  void mSetReference(double reference) { mReference = reference; }

  double mCalcTOSTPower(double difference, int n) const;
  // The working-scale lower and upper limits, after mComputeAndStore.
  double mGetLowerLimit() const { return mLowerLimit; }
  double mGetUpperLimit() const { return mUpperLimit; }
  double mGetPowerAtCenter() const { return mPowerAtCenter; }
  const std::vector<double>& mGetPowersFound() const { return mPowersFound; }

  // The solvers of one pair, on the working scale.
  double mCalcTOSTMeansDifference(double power, int n);
  double mCalcMeansDifferencesRootUtility(double start, int n, double power);
  int mCalcTOSTSampleSize(double difference, double power);
  int mCalcSampleSizeRootUtility(double difference, double power, int lowest);
  int mCalculateSampleSizeForOneSidedTest(double difference, double power);

  // The reflection of d in the centre of the interval.
  double mGetSymmetricDifference(double d, int, double) const {
    return mLowerLimit + mUpperLimit - d;
  }
  int mGetMinSampleSize() const;
  void mGetScaleMinMax(double* a, double* b, double& low, double& high) const;
  void mGetSuggestedXMinXMax(const std::vector<double>& data, double* xMin, double* xMax);

  // The noncentralities: (d - lower) / w first, then (d - upper) / w, with
  // w = sqrt(c / n) sigma, c = 2 for two independent samples, else 1; a
  // one-sided alternative has only the one of its limit.
  static std::vector<double> mGetLambda(int n, double difference, double sigma, bool oneSample,
                                        double lower, double upper, ETOSTTestType type,
                                        EAlternative alternative);
  // The power of the test: for the two-sided form the noncentral t
  // difference T(-t; df, b) - T(t; df, a), clamped at 0; one-sided forms
  // are one-sided t tests against their limit.
  static double mTOSTPower(int n, double difference, double target, double level, double sigma,
                           bool ratio, bool, bool oneSample, bool noncentralityFromN, double lower,
                           double upper, ETOSTTestType type, EAlternative alternative);

 protected:
  void mCalculateMeansDifferences();
  double mSolveLeftHalf(double start, double startPower, double end, int n, double power);
  void mCalculateSampleSizes();
  bool mLimitsUsable() const;
  double mToUser(double x) const;
  double mToWorking(double x) const;
  void mStoreDifferencePair(int& row, int n, double d, double target);

  ETOSTTestType mTestType;
  bool mRatio;
  bool mUnused;
  bool mNoncentralityFromN;
  double mLowerLimit;
  double mUpperLimit;
  double mReference;
  std::vector<double> mPowersFound;
  double mPowerAtCenter;
  double mUserLower;
  double mUserUpper;
};

// The TOST power minus the target, with the difference or (solving for
// the sample size) n as the unknown.
class CmTOSTPower : public CmPowerFunction {
 public:
  CmTOSTPower(const CmCmndPowerTOST& command, int n, double difference, double target,
              bool solveForSampleSize);
  double mPowerAt(double x) const override;
  const CmCmndPowerTOST& mCommand;
  int mN;
  double mDifference;
};

}  // namespace qel

#endif
