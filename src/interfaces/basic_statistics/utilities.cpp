// Mean, variance, covariance and correlation in one pass.
//
// The mean and the centred sums of squares and products are updated element
// by element (Welford, Technometrics 4 (1962) 419; West, CACM 22 (1979) 532):
// with d = x[i] - mean and e = d / (i+1), the mean grows by e and the sum of
// squares by i*e*d. Each running quantity is a compensated sum, so that the
// increments, which become small against the accumulated value, keep their
// low-order bits. This replaces the textbook two-pass formulas everywhere.
#include "interfaces/basic_statistics/utilities.h"

#include <qel/basic_types.h>

#include <cmath>
#include <limits>
#include <new>
#include <vector>

namespace qel {
namespace v1 {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

// Updating mean and sum of squares over x[0..n-1], n >= 1.
struct MeanAndSumOfSquares {
  CompensatedSum mean;
  CompensatedSum sumOfSquares;
};

MeanAndSumOfSquares updateMeanAndSumOfSquares(double const* x, unsigned int n) {
  MeanAndSumOfSquares r{CompensatedSum(x[0]), CompensatedSum()};
  for (unsigned int i = 1; i < n; ++i) {
    const double d = x[i] - r.mean.sum;
    const double e = d / (i + 1.0);
    r.mean.add(e);
    r.sumOfSquares.add((i * e) * d);
  }
  return r;
}

// Both updating means and the centred sums Sxx, Syy, Sxy, n >= 1.
struct CrossSums {
  CompensatedSum meanX, meanY, sxx, syy, sxy;
};

CrossSums updateCrossSums(double const* x, double const* y, unsigned int n) {
  CrossSums r;
  r.meanX = CompensatedSum(x[0]);
  r.meanY = CompensatedSum(y[0]);
  for (unsigned int i = 1; i < n; ++i) {
    const double dx = x[i] - r.meanX.sum;
    const double ex = dx / (i + 1.0);
    const double dy = y[i] - r.meanY.sum;
    const double ey = dy / (i + 1.0);
    r.sxx.add(ex * (dx * i));
    r.syy.add(ey * (i * dy));
    r.sxy.add(dx * (i * ey));
    r.meanX.add(ex);
    r.meanY.add(ey);
  }
  return r;
}

}  // namespace

SecondSampleMoments::SecondSampleMoments()
    : variance(kNaN), sumOfSquares(kNaN), mean(kNaN), sum(kNaN), n(0) {}

double GetSampleMean(double const* x, unsigned int n) {
  if (n == 0) return kNaN;
  CompensatedSum mean(x[0]);
  for (unsigned int i = 1; i < n; ++i) mean.add((x[i] - mean.sum) / (i + 1.0));
  return mean.sum;
}

double GetSampleVariance(double const* x, unsigned int n) {
  if (n == 0) return kNaN;
  if (n == 1) return 0.0;
  return updateMeanAndSumOfSquares(x, n).sumOfSquares.sum / (n - 1.0);
}

double GetSampleVariance(double const* x, unsigned int n, double center) {
  if (n == 0) return kNaN;
  if (n == 1) return 0.0;
  CompensatedSum squares, deviations;
  for (unsigned int i = 0; i < n; ++i) {
    const double d = x[i] - center;
    squares.add(d * d);
    deviations.add(d);
  }
  return (squares.sum - deviations.sum * deviations.sum / n) / (n - 1.0);
}

void GetSampleMeanAndVariance(double const* x, unsigned int n, double* mean, double* variance) {
  if (n == 0) {
    *mean = kNaN;
    *variance = kNaN;
    return;
  }
  const MeanAndSumOfSquares r = updateMeanAndSumOfSquares(x, n);
  *mean = r.mean.sum;
  *variance = n == 1 ? 0.0 : r.sumOfSquares.sum / (n - 1.0);
}

void CalculateMeanAndStdDev(double const* x, unsigned int n, double* mean, double* stdDev) {
  double variance;
  GetSampleMeanAndVariance(x, n, mean, &variance);
  *stdDev = std::sqrt(variance);
}

double GetCovariance(double const* x, double const* y, unsigned int n, double* varianceX,
                     double* varianceY) {
  if (n < 2) return kNaN;
  const CrossSums r = updateCrossSums(x, y, n);
  const double m = n - 1.0;
  *varianceX = r.sxx.sum / m;
  *varianceY = r.syy.sum / m;
  return r.sxy.sum / m;
}

double GetCenteredCrossProduct(double const* x, double const* y, unsigned int n, double* sumSqX,
                               double* sumSqY) {
  if (n < 2) {
    *sumSqX = 0.0;
    *sumSqY = 0.0;
    return 0.0;
  }
  const CrossSums r = updateCrossSums(x, y, n);
  *sumSqX = r.sxx.sum;
  *sumSqY = r.syy.sum;
  return r.sxy.sum;
}

double GetPearsonCorrelation(double const* x, double const* y, unsigned int n) {
  if (n < 2) return kNaN;
  const CrossSums r = updateCrossSums(x, y, n);
  const double sxy = r.sxy.sum;
  // From the squared ratio: a zero variance gives 0/0, NaN, as it stands.
  const double rho = std::sqrt(sxy * sxy / (r.sxx.sum * r.syy.sum));
  return sxy < 0.0 ? -rho : rho;
}

double GetSpearmanCorrelation(double const* x, double const* y, unsigned int n, int* status) {
  try {
    std::vector<double> rankX(n), rankY(n);
    if (GetRank(x, n, rankX.data()) != 0 || GetRank(y, n, rankY.data()) != 0) return kNaN;
    *status = 0;
    return GetPearsonCorrelation(rankX.data(), rankY.data(), n);
  } catch (const std::bad_alloc&) {
    *status = qelFailOutOfMemory;
    return kNaN;
  }
}

void GetSecondSampleMoments(SecondSampleMoments* moments, double const* x) {
  double mean, variance;
  GetSampleMeanAndVariance(x, moments->n, &mean, &variance);
  const double n = moments->n;
  moments->mean = mean;
  moments->variance = variance;
  moments->sum = n * mean;
  moments->sumOfSquares = (n * mean) * mean + (n - 1.0) * variance;
}

}  // namespace v1
}  // namespace qel
