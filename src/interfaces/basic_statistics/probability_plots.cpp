// Probability-plot data: plotting positions, the scores of the fitted
// distribution at them, the estimated parameters with their covariance
// matrix, and the Anderson-Darling test of the fit.
//
// Plotting positions (i + a)/(n + d), i = 0..n-1: Benard's median-rank
// approximation (i + 0.7)/(n + 0.4), the mean rank (i + 1)/(n + 1) of Herd and
// Johnson, Hazen's midpoint (i + 0.5)/n and the Kaplan-Meier step (i + 1)/n.
#include <qel/descriptive.h>
#include <qel/fits.h>

#include <cmath>
#include <limits>
#include <new>
#include <vector>

#include "interfaces/basic_statistics/fits.h"
#include "interfaces/basic_statistics/utilities.h"
#include "interfaces/math/random_distributions_v1.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

// Positions into p in a parallel loop; false (and NaN everywhere) for an
// unknown method.
bool FillPositions(double* p, unsigned n, PlottingMethod method) {
  double a = 0.0, d = 0.0;
  switch (method) {
    case kPlotMedianRank:
      a = 0.7, d = n + 0.4;
      break;
    case kPlotMeanRank:
      a = 1.0, d = n + 1.0;
      break;
    case kPlotMidpoint:
      a = 0.5, d = n;
      break;
    case kPlotStep:
      a = 1.0, d = n;
      break;
    default:
      for (unsigned i = 0; i < n; ++i) p[i] = kNaN;
      return false;
  }
  const long count = static_cast<long>(n);
#pragma omp parallel for schedule(static)
  for (long i = 0; i < count; ++i) p[i] = (i + a) / d;
  return true;
}

// Steps 1 to 3 of every plot: positions into scores, a copy into
// probabilities when asked; false after an unknown method.
bool StartPlot(double* scores, double* probabilities, unsigned n, PlottingMethod method) {
  const bool known = FillPositions(scores, n, method);
  if (probabilities != nullptr)
    for (unsigned i = 0; i < n; ++i) probabilities[i] = scores[i];
  return known;
}

void SetNaN(double* x, unsigned count) {
  if (x != nullptr)
    for (unsigned i = 0; i < count; ++i) x[i] = kNaN;
}

// Scores of the exponential and Weibull plots: log(-log(1 - p)), with log1p
// so that small positions keep their accuracy; p = 1 gives +infinity.
void LogLogScores(double* scores, unsigned n) {
  for (unsigned i = 0; i < n; ++i) scores[i] = std::log(-std::log1p(-scores[i]));
}

}  // namespace

namespace v1 {

int CreatePointProbabilities(double* probabilities, unsigned n, PlottingMethod method) {
  return FillPositions(probabilities, n, method) ? qelOk : qelFailBadEnumValue;
}

void EstimateParametersForNormal(double const* sorted, double* parameters, double* covariances,
                                 unsigned n) {
  // Welford's updating loop for the mean and the sum of squared deviations.
  double mean = n == 0 ? kNaN : 0.0, ss = 0.0;
  for (unsigned i = 0; i < n; ++i) {
    const double delta = sorted[i] - mean;
    mean += delta / (i + 1.0);
    ss += delta * (sorted[i] - mean);
  }
  const double s2 = n == 0 ? kNaN : (n == 1 ? 0.0 : ss / (n - 1.0));
  parameters[0] = mean;
  parameters[1] = std::sqrt(s2);
  if (covariances == nullptr) return;
  covariances[0] = s2 / n;
  covariances[1] = 0.0;
  if (n <= 1) {
    covariances[2] = kNaN;
    return;
  }
  // Var(s) = s2*(1 - c4^2), c4^2 = 2/(n-1) * (Gamma(n/2)/Gamma((n-1)/2))^2,
  // with 1 - c4^2 formed by expm1 to keep it accurate for large n.
  const double h = 0.5 * n;
  covariances[2] = -std::expm1(2.0 * (mLogGamma(h) - mLogGamma(h - 0.5)) - std::log(h - 0.5)) * s2;
}

int RunLynNormalPPlot(double const* sorted, double* scores, double* probabilities,
                      double* parameters, double* covariances, double* adStatistic,
                      double* adPValue, unsigned n, PlottingMethod method) {
  if (!StartPlot(scores, probabilities, n, method)) {
    SetNaN(parameters, 2);
    SetNaN(covariances, 3);
    *adStatistic = *adPValue = kNaN;
    return qelFailBadEnumValue;
  }
  for (unsigned i = 0; i < n; ++i) scores[i] = NormalInvCdf(scores[i], 0.0, 1.0);
  EstimateParametersForNormal(sorted, parameters, covariances, n);
  return RunLynNormalADTest(sorted, parameters, adStatistic, adPValue, n);
}

int RunLynLogNormalPPlot(double const* sorted, double* scores, double* probabilities,
                         double* parameters, double* covariances, double* adStatistic,
                         double* adPValue, unsigned n, PlottingMethod method) {
  try {
    std::vector<double> logs(n);
    for (unsigned i = 0; i < n; ++i) logs[i] = std::log(sorted[i]);
    return RunLynNormalPPlot(logs.data(), scores, probabilities, parameters, covariances,
                             adStatistic, adPValue, n, method);
  } catch (const std::bad_alloc&) {
    SetNaN(parameters, 2);
    SetNaN(covariances, 3);
    *adStatistic = *adPValue = kNaN;
    return qelFailOutOfMemory;
  }
}

}  // namespace v1

namespace v0 {

void invert(double* m) {
  const double det = m[2] * m[0] - m[1] * m[1];
  const double covariance = -m[1] / det;
  const double first = (1.0 - m[1] * covariance) / m[0];
  const double second = m[0] / det;
  m[0] = first;
  m[1] = covariance;
  m[2] = second;
}

// Observed information of the Weibull log-likelihood
//   n log b - n b log a + (b - 1) sum log x - sum (x/a)^b
// at its maximum (where sum (x/a)^b = n), inverted.
void DetermineVar(double const* sorted, double const* parameters, double* covariances, unsigned n) {
  const double b = parameters[0], a = parameters[1];
  double sums[2] = {0.0, 0.0};
  // Two independent compensated sums, one per thread.
#pragma omp parallel for schedule(static)
  for (int section = 0; section < 2; ++section) {
    v1::CompensatedSum sum;
    for (unsigned i = 0; i < n; ++i) {
      if (section == 0) {
        const double z = std::log(sorted[i] / a);
        sum.add(std::pow(sorted[i] / a, b) * z * z);
      } else {
        sum.add(std::log(sorted[i]));
      }
    }
    sums[section] = sum.sum;
  }
  const double i11 = n / (b * b) + sums[0];
  const double i12 = (n * std::log(a) - (n / b + sums[1])) * (b / a);
  const double i22 = n * (b / a) * (b / a);
  covariances[0] = i11;
  covariances[1] = i12;
  covariances[2] = i22;
  invert(covariances);
}

int RunLynExponentialPPlot(double const* sorted, double* scores, double* probabilities,
                           double* parameter, double* covariance, double* adStatistic,
                           double* adPValue, unsigned n, PlottingMethod method) {
  if (!StartPlot(scores, probabilities, n, method)) {
    *parameter = *adStatistic = *adPValue = kNaN;
    SetNaN(covariance, 1);
    return qelFailBadEnumValue;
  }
  LogLogScores(scores, n);
  const double scale = v1::GetSampleMean(sorted, n);
  *parameter = scale;
  if (covariance != nullptr) *covariance = scale * scale / n;
  return RunLynExponentialADTest(sorted, scale, adStatistic, adPValue, n);
}

int RunLynWeibullPPlot(double const* sorted, double* scores, double* probabilities,
                       double* parameters, double* covariances, double* adStatistic,
                       double* adPValue, unsigned n, PlottingMethod method) {
  if (!StartPlot(scores, probabilities, n, method)) {
    SetNaN(parameters, 2);
    SetNaN(covariances, 3);
    *adStatistic = *adPValue = kNaN;
    return qelFailBadEnumValue;
  }
  LogLogScores(scores, n);
  // A fit that did not converge still gives the last values, which are
  // plotted and tested as they are.
  if (v2::FitWeibull(sorted, parameters, n) == qelFailOutOfMemory) {
    SetNaN(covariances, 3);
    *adStatistic = *adPValue = kNaN;
    return qelFailOutOfMemory;
  }
  if (covariances != nullptr) DetermineVar(sorted, parameters, covariances, n);
  return RunLynWeibullADTest(sorted, parameters, adStatistic, adPValue, n);
}

}  // namespace v0
}  // namespace qel
