// Distribution kernels: m<Family>Pdf, m<Family>Cdf and m<Family>InvCdf.
//
// Kernels work in double precision, return the missing value when they have no
// answer and never touch the floating-point state. They check no parameters;
// validity is the business of the distribution classes. A kernel catches
// std::runtime_error (a trapped overflow or division by zero, or the "float
// overflow" of the checked functions) only where its family says so.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_H

#include <qel/basic_types.h>

#include <map>

#include "utilities/RootsAndOptima.h"

namespace qel {

// Closed-form families.
double mUniformPdf(double x, double lower, double upper);
double mUniformCdf(double x, double lower, double upper, bool upperTail);
double mUniformInvCdf(double p, double lower, double upper);

double mTriangularPdf(double x, double lower, double mode, double upper);
double mTriangularCdf(double x, double lower, double mode, double upper, bool upperTail);
double mTriangularInvCdf(double p, double lower, double mode, double upper);

double mLogisticPdf(double x, double location, double scale);
double mLogisticCdf(double x, double location, double scale, bool upperTail);
double mLogisticInvCdf(double p, double location, double scale);

double mLogLogisticPdf(double x, double location, double scale, double threshold);
double mLogLogisticCdf(double x, double location, double scale, double threshold, bool upperTail);
double mLogLogisticInvCdf(double p, double location, double scale, double threshold);

double mCauchyPdf(double x, double location, double scale);
double mCauchyCdf(double x, double location, double scale, bool upperTail);
double mCauchyInvCdf(double p, double location, double scale);

// ---------------------------------------------------------------------------
// Continuous kernels on the ELV routines. Inverse kernels of the ELV families
// work from the nearer tail; a Cdf's upper tail is the second result of the
// same computation, never 1 minus the first.

// Absolute tolerance in x of the quantile searches (in place of the default
// of CmRealFunction), so that tiny quantiles are found to relative accuracy.
constexpr double kQuantileSearchToleranceX = 2.2250738585072014e-288;

// Lower tail of the standard normal distribution minus the target p.
class CmStandardNormalCdf : public CmRealFunction {
 public:
  explicit CmStandardNormalCdf(double p);
  double operator()(double x) override;
  double mP;
};

double mNormalPdf(double x, double mean, double sigma);
double mNormalCdf(double x, double mean, double sigma, bool upperTail);
// Both tails; false (and missing tails) when there is no answer.
bool mNormalCdf(double x, double mean, double sigma, double* lower, double* upper);
double mNormalInvCdf(double p, double mean, double sigma);
double mNormalPValue(double z, EAlternative alternative);
double mNormalCritValue(double alpha, EAlternative alternative);

double mLogNormalPdf(double x, double location, double scale, double threshold);
double mLogNormalCdf(double x, double location, double scale, double threshold, bool upperTail);
double mLogNormalInvCdf(double p, double location, double scale, double threshold);

double mHalfNormalPdf(double x, double scale, double location);
double mHalfNormalCdf(double x, double scale, double location, bool upperTail);
double mHalfNormalInvCdf(double p, double scale, double location);

double mExponentialPdf(double x, double scale, double threshold);
double mExponentialCdf(double x, double scale, double threshold, bool upperTail);
double mExponentialInvCdf(double p, double scale, double threshold);

double mLargestExtremeValuePdf(double x, double location, double scale);
double mLargestExtremeValueCdf(double x, double location, double scale, bool upperTail);
double mLargestExtremeValueInvCdf(double p, double location, double scale);
double mSmallestExtremeValuePdf(double x, double location, double scale);
double mSmallestExtremeValueCdf(double x, double location, double scale, bool upperTail);
double mSmallestExtremeValueInvCdf(double p, double location, double scale);

double mWeibullPdf(double x, double shape, double scale, double threshold);
double mWeibullCdf(double x, double shape, double scale, double threshold, bool upperTail);
double mWeibullInvCdf(double p, double shape, double scale, double threshold);

double mLaplacePdf(double x, double location, double scale);
double mLaplaceCdf(double x, double location, double scale, bool upperTail);
double mLaplaceInvCdf(double p, double location, double scale);

// Tukey's lambda: the quantile function (p^lambda - (1 - p)^lambda)/lambda
// minus the target z, searched over p in [0, 1] by the Cdf and Pdf.
class CmLambdaTransform : public CmRealFunction {
 public:
  CmLambdaTransform(double lambda, double z);
  double operator()(double p) override;
  double mLambda;
  double mZ;
};

double mLambdaPdf(double x, double lambda, double location, double scale);
double mLambdaCdf(double x, double lambda, double location, double scale, bool upperTail);
double mLambdaInvCdf(double p, double lambda, double location, double scale);

// Lower tail of the standard gamma distribution minus the target p.
class CmGammaCdf : public CmRealFunction {
 public:
  CmGammaCdf(double shape, double p);
  double operator()(double x) override;
  double mShape;
  double mP;
};

double mGammaPdf(double x, double shape, double scale, double threshold);
double mGammaCdf(double x, double shape, double scale, double threshold, bool upperTail);
double mGammaInvCdf(double p, double shape, double scale, double threshold);
// The standard gamma quantile at p searched upward from [0, start].
double mGammaInvCdfByRootFinder(double p, double shape, double start);

// Lower tail of the (noncentral) chi-square distribution minus the target p;
// 0 for x <= 0, missing for a missing x.
class CmChiSqCdf : public CmRealFunction {
 public:
  CmChiSqCdf(double df, double noncentrality, double p);
  double operator()(double x) override;
  double mDf;
  double mNoncentrality;
  double mP;
};

double mChiSqPdf(double x, double df);
double mChiSqCdf(double x, double df, double noncentrality, bool upperTail);
// Both tails; false (and missing tails) when there is no answer.
bool mChiSqCdf(double x, double df, double noncentrality, double* lower, double* upper);
double mChiSqInvCdf(double p, double df, double noncentrality);
double mChiSqInvCdfByRootFinder(double p, double df, double noncentrality, double start);
double mChiSqPValue(double x, double df, EAlternative alternative);
double mChiSqCritValue(double alpha, double df, EAlternative alternative);

// Student's t lower tail (noncentral) minus the target p.
class CmTCdf : public CmRealFunction {
 public:
  CmTCdf(double df, double noncentrality, double p);
  double operator()(double x) override;
  double mDf;
  double mNoncentrality;
  double mP;
};

double mTPdf(double x, double df, double noncentrality);
double mTCdf(double x, double df, double noncentrality, bool upperTail);
// Both tails; false (and missing tails) when there is no answer.
bool mTCdf(double x, double df, double noncentrality, double* lower, double* upper);
double mTInvCdf(double p, double df, double noncentrality);
double mTPValue(double t, double df, EAlternative alternative);
// Critical values for k comparisons: Bonferroni (alpha/k) and Sidak
// (1 - (1 - alpha)^(1/k)) per comparison.
double mTCritValue(double alpha, double df, EAlternative alternative, int k);
double mTSidakCritValue(double alpha, double df, EAlternative alternative, int k);

double mBetaPdf(double x, double a, double b);
double mBetaCdf(double x, double a, double b, bool upperTail);
double mBetaInvCdf(double p, double a, double b);

// Lower tail of the (noncentral) F distribution minus the target p.
class CmFCdf : public CmRealFunction {
 public:
  CmFCdf(double df1, double df2, double noncentrality, double p);
  double operator()(double x) override;
  double mDf1;
  double mDf2;
  double mNoncentrality;
  double mP;
};

double mFPdf(double x, double df1, double df2);
double mFCdf(double x, double df1, double df2, double noncentrality, bool upperTail);
bool mFCdf(double x, double df1, double df2, double noncentrality, double* lower, double* upper);
double mFInvCdf(double p, double df1, double df2, double noncentrality);
double mFPValue(double x, double df1, double df2, EAlternative alternative);
double mFCritValue(double alpha, double df1, double df2, EAlternative alternative);

// ---------------------------------------------------------------------------
// Discrete kernels. x should be a whole number: a Pdf answers 0 unless x is
// an integer within fuzz 0; a Cdf takes that integer, or else floor(x). The
// upper tail is P(X >= x): it includes the point.

// The log likelihood ratio of k successes in n trials against probability p.
double mLRatio(int n, int k, double p);

// mLRatio(n, truncated x, p) minus the target.
class CmLRatio : public CmRealFunction {
 public:
  CmLRatio(int n, double p);
  double operator()(double x) override;
  int n;
  double p;
};

double mBinomialPdf(double x, int n, double p);
double mBinomialCdf(double x, double n, double p, bool upperTail);
double mBinomialInvCdf(double p, int n, double prob);
double mBinomialPValue(double x, int n, double p, EAlternative alternative);

double mPoissonPdf(double x, double mean);
double mPoissonCdf(double x, double mean, bool upperTail);
double mPoissonInvCdf(double p, double mean);

// Negative binomial lower (or, with tail, upper) tail at x minus the target.
class CmNegBinomialCdf : public CmRealFunction {
 public:
  CmNegBinomialCdf(double p, double r, double target, bool tail);
  double operator()(double x) override;
  double mP;
  double mR;
  bool mTail;
};

// x counts the trials up to and including the r-th success.
double mNegBinomialPdf(double x, double p, double r);
double mNegBinomialCdf(double x, double p, double r, bool upperTail);
double mNegBinomialInvCdf(double p, double prob, double r);
double mGeometricPdf(double x, double p);
double mGeometricCdf(double x, double p, bool upperTail);
double mGeometricInvCdf(double p, double prob);

// Population N with M marked, sample n.
double mHypergeometricPdf(double x, int N, int M, int n);
double mHypergeometricCdf(double x, int N, int M, int n, bool upperTail);
double mHypergeometricInvCdf(double p, int N, int M, int n);
// Fisher's exact test on the table: one-sided tails, or the two-sided sum
// over the outcomes no more probable than x.
double mHypergeometricPValue(int x, int N, int M, int n, EAlternative alternative);

double mIntegerUniformPdf(double x, int a, int b);
double mIntegerUniformCdf(double x, int a, int b, bool upperTail);
double mIntegerUniformInvCdf(double p, int a, int b);

// A finite distribution given as value -> probability.
double mDiscretePdf(double x, const std::map<double, double>& table);
double mDiscreteCdf(double x, const std::map<double, double>& table, bool upperTail);
double mDiscreteInvCdf(double p, const std::map<double, double>& table);
// The same inverse on cumulative probability -> value, as used by random draws.
double mDiscreteInvCdf(double p, const std::multimap<double, double>& cumulative);

}  // namespace qel

#endif
