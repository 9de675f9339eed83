// Maximum-likelihood fits of the exponential, normal, lognormal and Weibull
// distributions. The Weibull shape solves the likelihood equation written on
// the centred logarithms y = log x - mean(log x),
//   sum (1 - b*y) exp(b*y) = 0,
// by Newton's method (Cohen, Technometrics 7 (1965) 579, in the centred form
// that removes the mean of the logarithms from the exponents); the scale then
// follows in closed form.
#include <qel/descriptive.h>
#include <qel/fits.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <new>
#include <vector>

#include "interfaces/basic_statistics/fits.h"

namespace qel {
namespace v2 {
namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();
const int kMaxNewtonSteps = 50;
const double kStepTolerance = 1e-12;

// Logarithms of x into y, in a parallel loop.
void TakeLogarithms(double const* x, double* y, unsigned n) {
  const long count = static_cast<long>(n);
#pragma omp parallel for schedule(static)
  for (long i = 0; i < count; ++i) y[i] = std::log(x[i]);
}

}  // namespace

double NRRatio(double const* centeredLogs, double shape, unsigned n) {
  const long count = static_cast<long>(n);
  double a = 0.0, b = 0.0;
#pragma omp parallel for schedule(static) reduction(+ : a, b)
  for (long i = 0; i < count; ++i) {
    const double by = shape * centeredLogs[i];
    const double e = std::exp(by);
    a += (1.0 - by) * e;
    b += centeredLogs[i] * by * e;
  }
  return a / b;
}

void CenterData(double* y, unsigned n) {
  const double mean = v1::GetSampleMean(y, n);
  const long count = static_cast<long>(n);
#pragma omp parallel for schedule(static)
  for (long i = 0; i < count; ++i) y[i] -= mean;
}

double GetScale(double const* x, double* work, double shape, unsigned n) {
  // pow(1, NaN) is 1: without this test a failed shape would still give
  // the largest value as a scale.
  if (std::isnan(shape)) return kNaN;
  const double largest = *std::max_element(x, x + n);
  for (unsigned i = 0; i < n; ++i) work[i] = std::pow(x[i] / largest, shape);
  return largest * std::pow(v1::GetSampleMean(work, n), 1.0 / shape);
}

int FitExponential(double const* x, double* parameter, unsigned n) {
  *parameter = v1::GetSampleMean(x, n);
  return qelOk;
}

int FitLynNormal(double const* x, double* parameters, unsigned n) {
  double mean = kNaN, variance = kNaN;
  v1::GetSampleMeanAndVariance(x, n, &mean, &variance);
  parameters[0] = mean;
  parameters[1] = std::sqrt(variance);
  return qelOk;
}

int FitLynLogNormal(double const* x, double* parameters, unsigned n) {
  try {
    std::vector<double> y(n);
    TakeLogarithms(x, y.data(), n);
    return FitLynNormal(y.data(), parameters, n);
  } catch (const std::bad_alloc&) {
    parameters[0] = parameters[1] = kNaN;
    return qelFailOutOfMemory;
  }
}

int FitWeibull(double const* x, double* parameters, unsigned n) {
  try {
    std::vector<double> y(n);
    TakeLogarithms(x, y.data(), n);
    CenterData(y.data(), n);
    // The start puts the largest exponent b*y at max(2, log(n-1)), so that
    // exp(b*y) is moderate at the first step whatever the scale of the data.
    const double largest = n == 0 ? kNaN : *std::max_element(y.begin(), y.end());
    double shape = std::max(2.0, std::log(n - 1.0)) / largest;
    int status = qelFailNoFit;
    for (int round = 0; round < kMaxNewtonSteps; ++round) {
      const double step = NRRatio(y.data(), shape, n);
      shape += step;
      if (std::fabs(step) < kStepTolerance) {
        status = qelOk;
        break;
      }
    }
    parameters[0] = shape;
    parameters[1] = n == 0 ? kNaN : GetScale(x, y.data(), shape, n);
    return status;
  } catch (const std::bad_alloc&) {
    parameters[0] = parameters[1] = kNaN;
    return qelFailOutOfMemory;
  }
}

}  // namespace v2
}  // namespace qel
