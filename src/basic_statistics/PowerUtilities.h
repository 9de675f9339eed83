// Power formulas of the one- and two-sample designs, and the solvers that
// invert them for an effect or a sample size.
//
// Every formula answers the missing value where it cannot be evaluated (a
// sample too small, a level outside (0, 1), a degenerate variance, a
// noncentrality beyond the reach of the noncentral t kernel); none raises a
// message. A power written as 1 - F is computed as the kernel's upper tail,
// so that a power of 1e-12 keeps its relative accuracy.
//
// The alternative is read by its sign: a negative value counts the lower
// tail, a positive value the upper tail, zero both.
#ifndef QEL_SRC_BASIC_STATISTICS_POWERUTILITIES_H
#define QEL_SRC_BASIC_STATISTICS_POWERUTILITIES_H

#include <qel/basic_types.h>

#include <vector>

#include "utilities/RootsAndOptima.h"

namespace qel {

// Test of variances whose power is wanted.
enum ETestMethod : int {
  kVarianceChiSquareOrF = 0,  // chi-square (one sample) or F (two samples)
  kVarianceBonett = 1,        // Bonett's test on the log ratio
  kVarianceLevene = 2         // Levene's test (normal approximation)
};

// ---------------------------------------------------------------------------
// Formulas. n is the size of each sample; a two-sample design has n in both.

// t or z test of a mean or of two means. The noncentrality is used as given
// unless it is missing; otherwise effect sqrt(n) / sigma (one sample) or
// effect sqrt(n / 2) / sigma (two samples). df = n - 1 or 2n - 2.
double mTOneCalcOnePower(EAlternative alternative, int n, double effect, double sigma, double level,
                         bool oneSample, bool useT, double noncentrality);

// Normal approximation for one proportion against null, or two proportions
// (null and null + effect); critical is the standard normal critical value.
double mPOneCalcOnePower(EAlternative alternative, int n, double critical, double effect,
                         double null, bool oneSample);

// Normal approximation for a Poisson rate (rate + effect against rate), with
// lengths of observation lengths[0] (and lengths[1] for the second sample).
double mPoissonPower(EAlternative alternative, int n, double rate, double effect, double level,
                     const std::vector<double>& lengths, bool oneSample);

// The variance tests; ratio is of variances, or of standard deviations when
// ratioOfSigmas is set. Levene's formula falls back to the chi-square rule
// for one sample.
double mVariancePower(EAlternative alternative, int n1, int n2, double ratio, double level,
                      bool oneSample, bool ratioOfSigmas, ETestMethod method, double kurtosis);
double mChiSquareFVariancePower(EAlternative alternative, int n1, int n2, double ratio,
                                double level, bool oneSample, bool ratioOfSigmas);
double mLeveneTestPower(EAlternative alternative, int n1, int n2, double ratio, double level,
                        bool ratioOfSigmas);
// kurtosis is the excess kurtosis of the population (0 for the normal).
double mBonettTestPower(EAlternative alternative, int n1, int n2, double ratio, double level,
                        bool oneSample, bool ratioOfSigmas, double kurtosis);

// Welch's approximate degrees of freedom, and the power of Welch's test of a
// difference of means with standard deviations s1 and s2 (fractional df).
double mCalcWelchDF(int n1, int n2, double s1, double s2);
double mCalcWelchTTestPower(EAlternative alternative, int n1, int n2, double difference, double s1,
                            double s2, double level);

// P(T < -t) for the noncentral t with df (fractional allowed) and
// noncentrality d >= 0, t > 0: the tail away from the noncentrality, to
// full relative accuracy however small it is.
double mNoncentralTOppositeTail(double t, double df, double d);

// x (1 - eps): an upper search end pulled just inside a limit.
double mReduceUpperEnd(double x);

// Design counts: the number of cells of a full factorial with these levels,
// and replicates times that number. Doubles, so that no product overflows.
double mGetTotalNumberOfCells(const std::vector<int>& levels);
double mGetTotalSamplesSize(int replicates, const std::vector<int>& levels);

// A whole sample size from a search result: the integer part, or -1 (the
// marker of a failed solve) for a missing, non-finite or out-of-range value.
int mSampleSizeFromDouble(double x);

// ---------------------------------------------------------------------------
// Function objects for the searches: operator() is the power minus the
// target (mTarget), or the missing value. The unknown x is the effect, or
// with mSolveForSampleSize the sample size, truncated to a whole number (the
// search then moves on whole numbers: mIntegerValued is set).

class CmPowerFunction : public CmRealFunction {
 public:
  CmPowerFunction(double target, bool solveForSampleSize);
  double operator()(double x) override;
  // The power at x, or the missing value.
  virtual double mPowerAt(double x) const = 0;
  bool mSolveForSampleSize;
};

class CmTPower : public CmPowerFunction {
 public:
  CmTPower(EAlternative alternative, int n, double effect, double sigma, double level,
           bool oneSample, bool useT, double target, bool solveForSampleSize);
  double mPowerAt(double x) const override;
  EAlternative mAlternative;
  int mN;
  double mEffect;
  double mSigma;
  double mLevel;
  bool mOneSample;
  bool mUseT;
  // Missing unless a caller fixes it; when x is a sample size and it is set,
  // it is recomputed as sqrt(n) effect / sigma.
  double mNoncentrality;
};

class CmPPower : public CmPowerFunction {
 public:
  CmPPower(EAlternative alternative, int n, double critical, double effect, double null,
           bool oneSample, double target, bool solveForSampleSize);
  double mPowerAt(double x) const override;
  EAlternative mAlternative;
  int mN;
  double mCritical;
  double mEffect;
  double mNull;
  bool mOneSample;
};

class CmVariancePower : public CmPowerFunction {
 public:
  CmVariancePower(EAlternative alternative, int n, double ratio, double level, bool oneSample,
                  bool ratioOfSigmas, ETestMethod method, double kurtosis, double target,
                  bool solveForSampleSize);
  double mPowerAt(double x) const override;
  EAlternative mAlternative;
  int mN;
  double mRatio;
  double mLevel;
  bool mOneSample;
  bool mRatioOfSigmas;
  ETestMethod mMethod;
  double mKurtosis;
};

class CmPoissonPower : public CmPowerFunction {
 public:
  CmPoissonPower(EAlternative alternative, int n, double rate, double effect, double level,
                 const std::vector<double>& lengths, bool oneSample, double target,
                 bool solveForSampleSize);
  double mPowerAt(double x) const override;
  EAlternative mAlternative;
  int mN;
  double mRate;
  double mEffect;
  double mLevel;
  std::vector<double> mLengths;
  bool mOneSample;
};

// When x is a sample size, both samples have it.
class CmWelchTPower : public CmPowerFunction {
 public:
  CmWelchTPower(EAlternative alternative, int n1, int n2, double difference, double s1, double s2,
                double level, double target, bool solveForSampleSize);
  double mPowerAt(double x) const override;
  EAlternative mAlternative;
  int mN1;
  int mN2;
  double mDifference;
  double mS1;
  double mS2;
  double mLevel;
};

// ---------------------------------------------------------------------------
// Solvers. An effect that cannot be found is the missing value; a sample
// size is the smallest whole number whose power reaches the target, the top
// of the search when none within it does, or -1 when the search fails.

// Search ends of the sample-size and effect searches.
bool mCalculateLowerUpperPos(double start, double step, double* lower, double* upper,
                             bool* rootAtLower, CmRealFunction& f, bool forSampleSize,
                             bool oneSample);
bool mCalculateLowerUpperNeg(double* lower, double* upper, CmRealFunction& f);
double mGetEffect(bool found, bool rootAtLower, double lower, double upper, CmRealFunction& f);
int mGetSampleSize(bool found, bool rootAtLower, double lower, double upper, CmRealFunction& f);

// t and z tests: the effect (signed by the alternative) that reaches power
// with n, and the sample size that reaches power with the effect. A paired
// test is one sample of differences; its sample-size search end is the
// two-sample one.
double mTComputeXForPowerAndSampleSize(double power, int n, double sigma, EAlternative alternative,
                                       double level, bool oneSample, bool useT);
int mTCalcSampleSizeGivenPower(EAlternative alternative, double power, double effect, double sigma,
                               double level, bool oneSample, bool useT, bool paired);

// Welch's test: equal sample sizes in the sample-size solver.
double mCalcEffectForWelchTTestPower(EAlternative alternative, double power, int n1, int n2,
                                     double s1, double s2, double level);
int mCalcSampleSizeForWelchTTestPower(EAlternative alternative, double power, double difference,
                                      double s1, double s2, double level);

// Proportions: the comparison proportion that reaches power with n (for the
// two-sided alternative the root above the null; the Other form gives the
// one below), and the sample size for the comparison null + effect.
double mComputePOneXForPowerAndSampleSize(EAlternative alternative, double power, int n,
                                          double critical, double null, bool oneSample);
double mComputePOneOtherXForPowerAndSampleSize(double power, int n, double critical, double null,
                                               bool oneSample);
int mCalcPOneSampleSizeGivenPower(EAlternative alternative, double power, double effect,
                                  double critical, double null, bool oneSample);

// Variances: the sample size for a ratio, and the ratio above one (positive)
// or below one that reaches power with n.
int mCalcVarSampleSizeGivenPower(EAlternative alternative, double power, double ratio, double level,
                                 bool oneSample, bool ratioOfSigmas, ETestMethod method,
                                 double kurtosis);
double mCalcVarEffectGivenPower(EAlternative alternative, double power, int n, double level,
                                bool oneSample, bool ratioOfSigmas, ETestMethod method,
                                double kurtosis, bool positive);

}  // namespace qel

#endif
