// The studentized maximum and maximum modulus of k normal variables
// Y_i = l_i Z + sqrt(1 - l_i^2) E_i (Z, E_i independent standard normal, so
// corr(Y_i, Y_j) = l_i l_j) over an independent s, s^2 df ~ chi-square(df):
//   P(max_i Y_i <= x s)   = int_0^inf f(s) int phi(z) prod_i Phi(a_i) dz ds,
//   P(max_i |Y_i| <= x s) = int_0^inf f(s) int phi(z) prod_i (Phi(a_i) - Phi(b_i)) dz ds,
//   a_i = (x s - l_i z)/c_i, b_i = (-x s - l_i z)/c_i, c_i = sqrt(1 - l_i^2),
//   f(s) = 2 (df/2)^(df/2) s^(df-1) exp(-df s^2/2) / Gamma(df/2).
// lambda = 0 gives Phi(xs)^k and (2 Phi(xs) - 1)^k. Equal lambdas are merged
// (ConsolidateLambdas), so the cost grows with the number of distinct values.
// P-values are upper tails computed in their own right (relative accuracy in
// the far tail); critical values are the search's root rounded to two
// decimals, except for k = 1 (Student's t quantile, not rounded).
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_STUDENTIZED_MAXIMUM_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_STUDENTIZED_MAXIMUM_H

#include <functional>
#include <vector>

namespace qel {

// Sorts the lambdas and merges equal ones: distinct ascending, counts their
// multiplicities. 0, or qelFailOutOfMemory (30001) with both emptied.
int mConsolidateLambdas(const std::vector<double>& values, std::vector<double>& distinct,
                        std::vector<unsigned>& counts);
int ConsolidateLambdas(const double* values, unsigned count, std::vector<double>& distinct,
                       std::vector<unsigned>& counts);

// The 48-point Gauss-Hermite rule for the weight exp(-x^2): nodes ascending
// and weights into two arrays of 48 (false, arrays untouched, if the
// eigensystem fails).
bool mGHArrayInit(double* nodes, double* weights);
// out[i] = Phi(z[i]), the standard normal cdf to full precision.
void mNCDFV(int count, const double* z, double* out);

// A conditional law given s = 1: U(w) = P(T > w) with sigma known.
class CbStudentizedInner {
 public:
  virtual ~CbStudentizedInner() = default;
  // U(w), computed in its own right.
  virtual double upperTail(double w) const = 0;
  // A cheap upper bound on U(w) (Bonferroni).
  virtual double upperBound(double w) const = 0;
  // A lower bound on the studentized tail P(T > x s).
  virtual double studentizedLowerBound(double x, double df) const = 0;
};

// The inner integrals at w = x s, either tail: mGHA1 the normal range W_k,
// mGHB1 the maximum, mGHC1 the maximum modulus (consolidated lambdas).
double mGHA1(double w, int k, bool upperTail);
double mGHB1(double w, const std::vector<double>& distinct, const std::vector<unsigned>& counts,
             bool upperTail);
double mGHC1(double w, const std::vector<double>& distinct, const std::vector<unsigned>& counts,
             bool upperTail);

// P(T > x s) = int f(s) U(x s) ds (df = inf: U(x)).
double mGLV(const CbStudentizedInner& inner, double x, double df);

// The x with upperTail(x) = alpha, decreasing upperTail, from the bracket
// [lower, upper] (widened when it does not hold the root): Illinois regula
// falsi on the logarithm to a relative width of 1e-10.
double mMRGFLS(const std::function<double(double)>& upperTail, double alpha, double lower,
               double upper);

// Brackets of the critical value at p = 1 - alpha from Student's t
// quantiles (normal for df = inf): range (pairs of k), maximum, modulus.
void mBDMCA2(int k, double df, double p, double* lower, double* upper);
void mBDMCB1(int k, double df, double p, double* lower, double* upper);
void mBDMCC2(int k, double df, double p, double* lower, double* upper);

// P-values P(T > x) and critical values (two decimals; k = 1 unrounded).
// The missing value for count 0, a null array, NaN arguments, |lambda| >= 1,
// df <= 0, alpha outside (0, 1), or when memory runs out. The modulus gives 1
// for x <= 0; the maximum takes any real x (P(max > 0) is an orthant
// probability).
double mStudentizedMaximumPValue(double x, double df, const double* lambdas, unsigned count);
double mStudentizedMaximumPValue(double x, double df, const std::vector<double>& lambdas);
double mStudentizedMaximumCritValue(double alpha, double df, const double* lambdas, unsigned count);
double mStudentizedMaximumCritValue(double alpha, double df, const std::vector<double>& lambdas);
double mStudentizedMaximumModulusPValue(double x, double df, const double* lambdas, unsigned count);
double mStudentizedMaximumModulusPValue(double x, double df, const std::vector<double>& lambdas);
double mStudentizedMaximumModulusCritValue(double alpha, double df, const double* lambdas,
                                           unsigned count);
double mStudentizedMaximumModulusCritValue(double alpha, double df,
                                           const std::vector<double>& lambdas);

}  // namespace qel

#endif
