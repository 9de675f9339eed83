/// \file
/// Goodness of fit and probability-plot data for the normal, lognormal,
/// exponential and Weibull distributions: the Anderson-Darling statistic with
/// the approximate P-values of D'Agostino and Stephens (1986), plotting
/// positions, and maximum-likelihood fits.
///
/// The data given to the test and plot functions must be sorted ascending;
/// the functions do not check it. They do not switch the floating-point state
/// and report no failure for data outside the support: a nonpositive value
/// for the lognormal or the Weibull reaches a logarithm, and the infinity or
/// NaN that results flows into the outputs.
#ifndef QEL_FITS_H
#define QEL_FITS_H

#include <qel/basic_types.h>
#include <qel/export.h>

namespace qel {

/// \name Anderson-Darling P-value status
/// Status of an Anderson-Darling P-value besides 0 (computed or
/// interpolated): the statistic lies beyond the largest tabled point and the
/// true P-value is below the one returned; or (Weibull) below the smallest
/// tabled point and the true P-value is above the one returned.
//@{
/// Beyond the largest tabled point: the true P-value is below the one returned.
constexpr int qelWarnADPValueUpperBound = 10003;
/// Below the smallest tabled point (Weibull): the true P-value is above the
/// one returned.
constexpr int qelWarnADPValueLowerBound = 10004;
//@}

namespace v1 {

/// Anderson-Darling test of a sorted sample against a normal law with
/// parameters[0] = location and parameters[1] = scale (for the lognormal: of
/// the logarithms of the data). n < 2 gives NaN in both outputs and status 0.
QEL_API int RunLynNormalADTest(double const* sorted, double const* parameters, double* statistic,
                               double* pValue, unsigned n);
/// The same against a lognormal law: the normal test on the logarithms of the
/// data, parameters[0] and parameters[1] their location and scale.
QEL_API int RunLynLogNormalADTest(double const* sorted, double const* parameters, double* statistic,
                                  double* pValue, unsigned n);

/// Plotting positions (i + a)/(n + b), i = 0..n-1, of the given method.
/// Returns 0, or 30002 with every element NaN for an unknown method.
QEL_API int CreatePointProbabilities(double* probabilities, unsigned n, PlottingMethod method);

/// Probability-plot data of a sorted sample: scores[i] the standard normal
/// quantile of the i-th plotting position, probabilities (may be null) the
/// positions, parameters the mean and standard deviation (of the logarithms
/// for the lognormal), covariances (may be null) their variance, covariance,
/// variance, and the Anderson-Darling statistic and P-value. Returns the
/// status of the test, 30002 for an unknown method, 30001 when memory runs out.
QEL_API int RunLynNormalPPlot(double const* sorted, double* scores, double* probabilities,
                              double* parameters, double* covariances, double* adStatistic,
                              double* adPValue, unsigned n, PlottingMethod method);
/// The same for the lognormal law: scores and the Anderson-Darling test on
/// the logarithms of the data.
QEL_API int RunLynLogNormalPPlot(double const* sorted, double* scores, double* probabilities,
                                 double* parameters, double* covariances, double* adStatistic,
                                 double* adPValue, unsigned n, PlottingMethod method);

}  // namespace v1

namespace v0 {

/// Anderson-Darling test against the exponential law of the given scale (mean).
QEL_API int RunLynExponentialADTest(double const* sorted, double scale, double* statistic,
                                    double* pValue, unsigned n);
/// Against the Weibull law, parameters[0] = shape and parameters[1] = scale.
QEL_API int RunLynWeibullADTest(double const* sorted, double const* parameters, double* statistic,
                                double* pValue, unsigned n);

/// Probability plots on log(-log(1 - p)) scores. For the exponential,
/// parameter and covariance are one double each (the mean and its variance);
/// for the Weibull, shape then scale with their 2x2 covariance (packed as
/// variance of the shape, covariance, variance of the scale).
QEL_API int RunLynExponentialPPlot(double const* sorted, double* scores, double* probabilities,
                                   double* parameter, double* covariance, double* adStatistic,
                                   double* adPValue, unsigned n, PlottingMethod method);
/// The Weibull plot: shape and scale with their packed 2x2 covariance.
QEL_API int RunLynWeibullPPlot(double const* sorted, double* scores, double* probabilities,
                               double* parameters, double* covariances, double* adStatistic,
                               double* adPValue, unsigned n, PlottingMethod method);

}  // namespace v0

namespace v2 {

/// Maximum-likelihood fits. The exponential: the mean. The normal: mean and
/// standard deviation (denominator n - 1). The lognormal: the same of the
/// logarithms. All return 0.
QEL_API int FitExponential(double const* x, double* parameter, unsigned n);
/// Normal: parameters[0] the mean, parameters[1] the standard deviation
/// (denominator n - 1). Returns 0.
QEL_API int FitLynNormal(double const* x, double* parameters, unsigned n);
/// Lognormal: the mean and standard deviation of the logarithms. Returns 0.
QEL_API int FitLynLogNormal(double const* x, double* parameters, unsigned n);
/// Weibull shape (Newton's method on the likelihood equation of the centred
/// logarithms) and scale. Returns 0; 20004 when 50 Newton steps do not
/// converge (the last values are kept); 30001 with NaN when memory runs out.
QEL_API int FitWeibull(double const* x, double* parameters, unsigned n);

}  // namespace v2
}  // namespace qel

#endif
