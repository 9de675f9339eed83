/// \file
/// Descriptive statistics of a column: one-pass compensated moments, sums,
/// correlation, sort order and ranks.
///
/// The functions take the data as they are: no element is tested for NaN or
/// for the missing value, so a NaN in the data reaches the results. They do
/// not switch the floating-point state. Too few observations give NaN (see
/// each function); only GetSpearmanCorrelation, GetRank and
/// GetCenteredOrderKPowerSums report message codes.
#ifndef QEL_DESCRIPTIVE_H
#define QEL_DESCRIPTIVE_H

#include <qel/export.h>

namespace qel {
namespace v1 {

/// Second-order sample moments. The constructor sets the doubles to NaN and
/// n to 0; the caller sets n before GetSecondSampleMoments.
struct SecondSampleMoments {
  /// Doubles NaN, n 0.
  QEL_API SecondSampleMoments();
  double variance;      ///< denominator n - 1
  double sumOfSquares;  ///< raw sum of squares: n*mean*mean + (n-1)*variance
  double mean;          ///< sample mean
  double sum;           ///< n*mean
  unsigned int n;       ///< number of observations; set by the caller
};

/// Mean: NaN for n = 0.
QEL_API double GetSampleMean(double const* x, unsigned int n);
/// Variance with denominator n - 1: NaN for n = 0, 0 for n = 1.
QEL_API double GetSampleVariance(double const* x, unsigned int n);
/// The same from sums of deviations from a caller-supplied centre near the
/// mean; accuracy is lost only in the final subtraction.
QEL_API double GetSampleVariance(double const* x, unsigned int n, double center);
/// Both at once: NaN and NaN for n = 0, x[0] and 0 for n = 1.
QEL_API void GetSampleMeanAndVariance(double const* x, unsigned int n, double* mean,
                                      double* variance);
/// Covariance (denominator n - 1), with both variances; for n < 2 NaN is
/// returned and the variances are not written.
QEL_API double GetCovariance(double const* x, double const* y, unsigned int n, double* varianceX,
                             double* varianceY);
/// Pearson's r; NaN for n < 2 and for a constant column.
QEL_API double GetPearsonCorrelation(double const* x, double const* y, unsigned int n);
/// Spearman's rho: Pearson's r of the average ranks. *status gets 0, or 30001
/// when memory runs out (NaN returned).
QEL_API double GetSpearmanCorrelation(double const* x, double const* y, unsigned int n,
                                      int* status);
/// out[0..k-1] gets the first k of: mean, and the central sums of powers 2, 3
/// and 4. Orders above four are not computed: out[4..k-1] get NaN and 30011
/// is returned; otherwise 0.
QEL_API int GetCenteredOrderKPowerSums(double const* x, unsigned int n, double* out,
                                       unsigned int k);
/// Compensated sum: NaN for n = 0.
QEL_API double GetSum(double const* x, unsigned int n);
/// out[i] = compensated sum of x[0..i]; out may be x. Nothing is written for
/// n = 0.
QEL_API void GetCumulativeSums(double const* x, unsigned int n, double* out);
/// out[i] = x[i] / sum of x; out may be x.
QEL_API void GetProportions(double const* x, unsigned int n, double* out);
/// Sample skewness (n >= 3) and excess kurtosis (n >= 4), adjusted for
/// sample size; NaN where n is too small or the data are constant.
QEL_API void GetLynSkewnessAndKurtosis(double const* x, unsigned int n, double* skewness,
                                       double* kurtosis);
/// Fills the record from its first n values of x.
QEL_API void GetSecondSampleMoments(SecondSampleMoments* moments, double const* x);

/// order[k] is the index of the (k+1)-th smallest element; the order within
/// ties is unspecified, NaN elements come last.
QEL_API void GetOrder(double const* x, unsigned int n, unsigned int* order);
/// Ranks from 1; exactly equal values get their average rank, NaN never ties.
/// Returns 0, or 30001 with every rank NaN when memory runs out.
QEL_API int GetRank(double const* x, unsigned int n, double* rank);

}  // namespace v1

namespace v0 {

/// Two-sided P-value of the t test of a correlation r from n pairs; NaN for
/// n <= 2.
QEL_API double GetLynCorrelationPValue(double r, unsigned int n);

}  // namespace v0
}  // namespace qel

#endif
