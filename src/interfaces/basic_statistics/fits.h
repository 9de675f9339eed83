// Inner side of the goodness-of-fit and probability-plot functions: the
// P-value approximations of the Anderson-Darling test and the pieces of the
// parameter fits.
#ifndef QEL_SRC_INTERFACES_BASIC_STATISTICS_FITS_H
#define QEL_SRC_INTERFACES_BASIC_STATISTICS_FITS_H

#include <qel/fits.h>

namespace qel {
namespace v1 {

// Approximate P-values of the Anderson-Darling statistic of a sample of n
// with estimated parameters; *status gets 0 or a bound code (10003, 10004).
double NormalADPValue(double statistic, int* status, unsigned n);
double ExponentialADPValue(double statistic, int* status, unsigned n);
double WeibullADPValue(double statistic, int* status, unsigned n);

// Mean and standard deviation of a sample by a plain updating loop, with the
// variance of the mean, 0, and the exact variance of the sample standard
// deviation of a normal sample (NaN for n <= 1); covariances may be null.
void EstimateParametersForNormal(double const* sorted, double* parameters, double* covariances,
                                 unsigned n);

}  // namespace v1

namespace v0 {

// Inverse observed information of the Weibull likelihood at the fitted
// parameters (shape, scale), packed as (var shape, covariance, var scale).
void DetermineVar(double const* sorted, double const* parameters, double* covariances, unsigned n);
// In-place inverse of a packed symmetric 2x2 matrix (a11, a12, a22).
void invert(double* symmetricTwoByTwo);

}  // namespace v0

namespace v2 {

// Newton step A/B for the Weibull shape b on centred logarithms y, with
// A = sum (1 - b*y)*exp(b*y) and B = sum b*y*y*exp(b*y).
double NRRatio(double const* centeredLogs, double shape, unsigned n);
// Subtracts the sample mean from every element.
void CenterData(double* y, unsigned n);
// Scale of a Weibull sample for the given shape: (mean of x^shape)^(1/shape),
// computed on x/max(x) so that the powers do not overflow. work holds n doubles.
double GetScale(double const* x, double* work, double shape, unsigned n);

}  // namespace v2
}  // namespace qel

#endif
