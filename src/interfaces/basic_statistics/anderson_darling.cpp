// The Anderson-Darling goodness-of-fit statistic, and the approximate
// P-values for the case where the parameters are estimated from the sample:
// D'Agostino, R. B. and Stephens, M. A. (1986), Goodness-of-Fit Techniques,
// Marcel Dekker, tables 4.9 (normal), 4.14 (exponential) and 4.17 (Weibull,
// critical values interpolated linearly).
#include <qel/distributions.h>
#include <qel/fits.h>

#include <cmath>
#include <limits>

#include "interfaces/basic_statistics/fits.h"
#include "interfaces/math/random_distributions_v1.h"

namespace qel {
namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

// A2 = -n - (1/n) sum (2i-1) log F_i + (2n+1-2i) log(1-F_i), i = 1..n, with F
// the fitted distribution function at the i-th sorted value. The sum is kept
// as a running mean, whose size stays near n instead of n*n; log1p keeps the
// upper-tail term accurate when F is small.
template <class Cdf>
double AndersonDarlingStatistic(double const* sorted, unsigned n, Cdf cdf) {
  double mean = 0.0;
  for (unsigned i = 1; i <= n; ++i) {
    const double f = cdf(sorted[i - 1]);
    const double term = (2.0 * i - 1.0) * std::log(f) + (2.0 * n + 1.0 - 2.0 * i) * std::log1p(-f);
    mean += (term - mean) / i;
  }
  return -(mean + n);
}

// Normal and lognormal with both parameters estimated (Stephens's case 3).
double NormalApproximation(double a2, int* status, unsigned n) {
  *status = qelOk;
  const double a = a2 * (1.0 + 0.75 / n + 2.25 / n / n);
  if (a <= 0.2) return -std::expm1(-13.436 + 101.14 * a - 223.73 * a * a);
  if (a <= 0.34) return -std::expm1(-8.318 + 42.796 * a - 59.938 * a * a);
  if (a <= 0.6) return std::exp(0.9177 - 4.279 * a - 1.38 * a * a);
  if (a <= 1.159) return std::exp(1.2937 - 5.709 * a + 0.0186 * a * a);
  if (a > 1.159) {
    *status = qelWarnADPValueUpperBound;
    return 0.005;
  }
  return kNaN;
}

// Exponential with the scale estimated.
double ExponentialApproximation(double a2, int* status, unsigned n) {
  *status = qelOk;
  const double a = a2 * (1.0 + 0.6 / n);
  if (a <= 0.26) return 1.0 - std::exp(-12.2204 + 67.459 * a - 110.3 * a * a);
  if (a <= 0.51) return 1.0 - std::exp(-6.1327 + 20.218 * a - 18.663 * a * a);
  if (a <= 0.95) return std::exp(0.9209 - 3.353 * a + 0.3 * a * a);
  if (a <= 2.534) return std::exp(0.731 - 3.009 * a + 0.15 * a * a);
  if (a > 2.534) {
    *status = qelWarnADPValueUpperBound;
    return 0.0025;
  }
  return kNaN;
}

// Weibull (extreme-value) with both parameters estimated: linear
// interpolation in the table of upper critical values.
double WeibullInterpolation(double a2, int* status, unsigned n) {
  static const double p[5] = {0.01, 0.025, 0.05, 0.1, 0.25};
  static const double c[5] = {1.038, 0.877, 0.757, 0.637, 0.474};
  *status = qelOk;
  const double a = a2 * (1.0 + 0.2 / std::sqrt(static_cast<double>(n)));
  if (a > c[0]) {
    *status = qelWarnADPValueUpperBound;
    return p[0];
  }
  if (a < c[4]) {
    *status = qelWarnADPValueLowerBound;
    return p[4];
  }
  for (int i = 1; i <= 4; ++i)
    if (c[i] < a) return (p[i - 1] - p[i]) / (c[i] - c[i - 1]) * (c[i] - a) + p[i];
  // Only a statistic exactly at the smallest point, or NaN, comes here.
  return a == c[4] ? p[4] : kNaN;
}

// The exported distribution functions are not given NaN: inside their
// armed frame an ordered comparison with NaN raises the invalid-operation
// trap. A NaN value or parameter gives F = NaN directly.

// The common end of the Run... forms: the statistic is written first, then
// the P-value with its status.
template <class Cdf, class PValue>
int RunADTest(double const* sorted, unsigned n, double* statistic, double* pValue, Cdf cdf,
              PValue pvalue) {
  if (n < 2) {
    *statistic = kNaN;
    *pValue = kNaN;
    return qelOk;
  }
  *statistic = AndersonDarlingStatistic(sorted, n, cdf);
  int status = qelOk;
  *pValue = pvalue(*statistic, &status, n);
  return status;
}

}  // namespace

namespace v1 {

double NormalADPValue(double statistic, int* status, unsigned n) {
  return NormalApproximation(statistic, status, n);
}
double ExponentialADPValue(double statistic, int* status, unsigned n) {
  return ExponentialApproximation(statistic, status, n);
}
double WeibullADPValue(double statistic, int* status, unsigned n) {
  return WeibullInterpolation(statistic, status, n);
}

int RunLynNormalADTest(double const* sorted, double const* parameters, double* statistic,
                       double* pValue, unsigned n) {
  const double location = parameters[0], scale = parameters[1];
  return RunADTest(
      sorted, n, statistic, pValue, [=](double x) { return NormalCdf(x, location, scale, false); },
      NormalApproximation);
}

int RunLynLogNormalADTest(double const* sorted, double const* parameters, double* statistic,
                          double* pValue, unsigned n) {
  const double location = parameters[0], scale = parameters[1];
  return RunADTest(
      sorted, n, statistic, pValue,
      [=](double x) { return NormalCdf(std::log(x), location, scale, false); },
      NormalApproximation);
}

}  // namespace v1

namespace v0 {

int RunLynExponentialADTest(double const* sorted, double scale, double* statistic, double* pValue,
                            unsigned n) {
  return RunADTest(
      sorted, n, statistic, pValue,
      [=](double x) {
        return std::isnan(x) || std::isnan(scale) ? kNaN
                                                  : qel::ExponentialCdf(x, scale, 0.0, false);
      },
      ExponentialApproximation);
}

int RunLynWeibullADTest(double const* sorted, double const* parameters, double* statistic,
                        double* pValue, unsigned n) {
  const double shape = parameters[0], scale = parameters[1];
  return RunADTest(
      sorted, n, statistic, pValue,
      [=](double x) {
        return std::isnan(x) || std::isnan(shape) || std::isnan(scale)
                   ? kNaN
                   : qel::WeibullCdf(x, shape, scale, 0.0, false);
      },
      WeibullInterpolation);
}

}  // namespace v0
}  // namespace qel
