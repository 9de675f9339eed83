// Bonett's (2006) intervals and tests for one variance and for the ratio of
// two standard deviations: the equations whose roots are the P-values and
// the limits, and their solvers.
//
// The equations are evaluated with every logarithm argument checked, so no
// floating-point trap can arise inside the C library; the normal tails that
// turn a root into a P-value enter the armed frame by themselves.
#ifndef QEL_SRC_BASIC_STATISTICS_VARIANCECOMPARISONUTIL_H
#define QEL_SRC_BASIC_STATISTICS_VARIANCECOMPARISONUTIL_H

#include <qel/basic_types.h>

#include "utilities/RootsAndOptima.h"

namespace qel {

// One sample as the ratio routines see it.
struct BonettCIForStdDevRatio {
  double kurtosis;
  double variance;
  double n;
};

// One-sample P-value equation in z. With s = -1 for `upper` (the lower
// limit n/(n-z) v exp(-z n se/(n-z)) meeting variance0 h) and s = +1
// otherwise (the upper limit meeting h):
//   f(z) = (n - z)(ln n - ln(n - z) + ln v - ln h) + s n z se,
// f(n) = s n^2 se and f(-DBL_MAX) = -DBL_MAX.
class CmBonettPValueFunction : public CmRealFunction {
 public:
  CmBonettPValueFunction(bool upper, double n, double variance, double standardError,
                         double variance0);
  double operator()(double z) override;
  bool mUpper;
  double mN, mVariance, mStandardError, mVariance0;
};

// Brackets the root of f: [t, n] for `upper`, with t = n - n v e^(n se - 1) / h
// (false when f(t) < 0: the lower limit never reaches h); otherwise [0, t]
// with t = n - n v e^(-n se - 1) / h when h >= v, and [n - n v e^(n se) / h, 0]
// when h < v.
bool mCalcStartValues(CmBonettPValueFunction& function, double* low, double* high);

// P-value of variance0 by Bonett's test: 1 - Phi(root); for "greater" 1
// when no root exists, for "not equal" twice the smaller side; 0 for an
// unknown alternative. The missing value when the root search fails.
double mCalcBonettPValue(EAlternative alternative, double n, double variance, double standardError,
                         double variance0);

// Two-sample P-value equation in z, r = v1/v2 and q the hypothesised
// variance ratio:
//   f(z) = ln(n1/n2) + ln((n2 - z)/(n1 - z)) - z se + ln r - ln q,
// ln of the lower limit of the variance ratio at quantile z, less ln q.
class CmTwoSamplePValueFunction : public CmRealFunction {
 public:
  CmTwoSamplePValueFunction(double n1, double n2, double standardError, double ratio,
                            double ratio0);
  double operator()(double z) override;
  double mN1, mN2, mStandardError, mRatio, mRatio0;
};

// The root of CmTwoSamplePValueFunction on its decreasing branch below
// min(n1, n2); the missing value when there is none.
double mSolvePValueEquation(double n1, double n2, double ratio, double ratio0,
                            double standardError);

// The top of the branch on which CmTwoSamplePValueFunction falls: the z of
// the smallest lower limit when n1 < n2, otherwise n2. Where f is positive
// there, the hypothesised ratio lies below every lower limit.
double mPValueEquationBranchTop(double n1, double n2, double standardError);

// Variance of the log variance ratio at the hypothesised variance ratio q.
double mBonettLogRatioVariance(BonettCIForStdDevRatio const& first,
                               BonettCIForStdDevRatio const& second, double q);

// The lower limit of sigma1/sigma2 at quantile z is the ratio rho at which
// the two-sample P-value equation meets z, with the variance recomputed at
// q = rho^2. In t = ln rho:
//   g(t) = ln(n1/n2) + ln((n2 - z)/(n1 - z)) + ln(v1/v2)
//          - z sqrt(V(e^(2t))) - 2t,
// V from mBonettLogRatioVariance; g falls from +inf to -inf.
class CmScaledRatioLCLFunc : public CmRealFunction {
 public:
  CmScaledRatioLCLFunc(BonettCIForStdDevRatio const& first, BonettCIForStdDevRatio const& second,
                       double z);
  double operator()(double t) override;
  BonettCIForStdDevRatio mFirst, mSecond;
  double mZ, mConstant;
};

// Whether limits at quantile z exist: both n above z and above 3, finite
// kurtoses, positive finite variances.
bool mCanWeDoTwoSampleBonett(BonettCIForStdDevRatio const& first,
                             BonettCIForStdDevRatio const& second, double z);

// The lower (or, by exchanging the samples, upper) limit of sigma1/sigma2
// at quantile z; the missing value when it cannot be found.
double mCalcConfLimitForRatioOfStDevs(bool upper, BonettCIForStdDevRatio const& first,
                                      BonettCIForStdDevRatio const& second, double z);

// The limits that the confidence type asks for (the other stays missing),
// with z = the normal critical value of alpha; false when one of them
// cannot be found.
bool mCalcCIForRatios(double* lower, double* upper, BonettCIForStdDevRatio& first,
                      BonettCIForStdDevRatio& second, double alpha, EConfidenceType type);

}  // namespace qel

#endif
