// The studentized range Q = R / s of k independent standard normal variables,
// R their range and s an independent estimate of sigma with df degrees of
// freedom (s^2 df ~ chi-square with df degrees of freedom):
//   P(Q <= q) = int_0^inf f(s) W_k(q s) ds,
//   W_k(w) = k int phi(z) (Phi(z) - Phi(z - w))^(k-1) dz (the normal range cdf),
//   f(s) = 2 (df/2)^(df/2) s^(df-1) exp(-df s^2/2) / Gamma(df/2).
// The P-value is computed on the upper tail in its own right, so small
// P-values keep their relative accuracy.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_STUDENTIZED_RANGE_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_STUDENTIZED_RANGE_H

namespace qel {

// Whether the tabulated and integrated critical values are trusted: k = 2
// always; df <= 2 only for alpha = 0.05 (within 1e-12) and k <= 10; not for
// k >= 40 with 2 < df <= 5; for alpha < 0.01 not for 15 <= k <= 40 with
// df <= 10, nor for k > 40.
bool mIsStudentizedRangePossible(int k, double df, double alpha);
// The same region for the maximum and the maximum modulus of k variables:
// k = 1 always; never for df <= 2; not for k >= 40 with df <= 5; the alpha
// rule of the range.
bool mIsStudentizedMaximumModulusPossible(int k, double df, double alpha);

// P(Q > q); the missing value for k < 2, df <= 0 or NaN arguments; 1 for
// q <= 0.
double mStudentizedRangePValue(double q, int k, double df);
// The q with P(Q > q) = alpha, rounded to two decimals (k = 2: sqrt(2) times
// the t quantile at 1 - alpha/2, not rounded); the missing value for alpha
// outside (0, 1), k < 2 or df <= 0.
double mStudentizedRangeCritValue(double alpha, int k, double df);
// Upper 5 percent point to two decimals for integer df in 1..60 and k in
// 3..10 when alpha is 0.05 within 1e-12; false otherwise.
bool mTukeyTable(double df, int k, double alpha, double* q);

}  // namespace qel

#endif
