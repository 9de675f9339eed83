// The five-number summary, the extended summary and the boxplot helper.
//
// The interval of the median is the sign-test interval interpolated between
// the two neighbouring order statistics, after Hettmansperger, T. P. and
// Sheather, S. J. (1986), "Confidence intervals based on interpolated order
// statistics", Statistics & Probability Letters 4, 75-79.
#include "interfaces/basic_statistics/summaries.h"

#include <qel/basic_types.h>
#include <qel/order_statistics.h>
#include <qel/summaries.h>

#include <cmath>
#include <limits>
#include <new>
#include <vector>

#include "interfaces/basic_statistics/order_statistics.h"
#include "interfaces/math/random_distributions_v1.h"

namespace qel {
namespace v1 {
namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr unsigned int kModeRoom = 5;
const double kFiveProbabilities[5] = {0.0, 0.25, 0.5, 0.75, 1.0};

void fillFive(FiveNumberSummary* five, double const* q) {
  five->minimum = q[0];
  five->firstQuartile = q[1];
  five->median = q[2];
  five->thirdQuartile = q[3];
  five->maximum = q[4];
}

// The value at depth h = (n+1)q of sorted data, interpolated linearly
// between neighbours; depths outside [1, n] take the nearest end.
double depthValue(double const* x, unsigned int n, double q) {
  const double h = n * q + q;
  double whole;
  const double f = std::modf(h, &whole);
  if (whole <= 0.0) return x[0];
  if (whole >= n) return x[n - 1];
  const auto g = static_cast<unsigned int>(whole);
  return (1.0 - f) * x[g - 1] + f * x[g];
}

// Limits from the depth d and a lower-tail cdf F of the number of
// observations below the median. For 0 < d < n/2 the intervals of depth d
// and d+1 cover with cw >= confidence >= cn; the limits move from the outer
// pair toward the inner one by Hettmansperger and Sheather's lambda. When d
// reaches n/2 the only narrower interval is the median itself (coverage 0).
template <class Cdf>
void signLimits(double* lower, double* upper, double confidence, double const* x, unsigned int n,
                double d, Cdf F) {
  *lower = kNaN;
  *upper = kNaN;
  if (n == 0 || !(d >= 1.0) || d > n) return;  // also d NaN
  const auto k = static_cast<unsigned int>(d);
  const double cw = 1.0 - 2.0 * F(d - 1.0);
  if (2.0 * d < n) {
    const double cn = 1.0 - 2.0 * F(d);
    const double I = (cw - confidence) / (cw - cn);
    const double lambda = (n - d) * I / (d + (n - 2.0 * d) * I);
    *lower = x[k - 1] + lambda * (x[k] - x[k - 1]);
    *upper = x[n - k] + lambda * (x[n - k - 1] - x[n - k]);
    return;
  }
  const double I = (cw - confidence) / cw;
  const double median = GetTypicalMedian(x, n);
  *lower = x[k - 1] + I * (median - x[k - 1]);
  *upper = x[n - k] + I * (median - x[n - k]);
}

}  // namespace

FiveNumberSummary::FiveNumberSummary()
    : minimum(kNaN), firstQuartile(kNaN), median(kNaN), thirdQuartile(kNaN), maximum(kNaN) {}

LynBoxplotHelper::LynBoxplotHelper()
    : minimum(kNaN),
      maximum(kNaN),
      firstQuartile(kNaN),
      median(kNaN),
      thirdQuartile(kNaN),
      medianLowerLimit(kNaN),
      medianUpperLimit(kNaN),
      lowerHinge(kNaN),
      upperHinge(kNaN),
      mean(kNaN),
      standardDeviation(kNaN) {}

void ExactTwoSidedCI(double* lower, double* upper, double confidence, double const* sorted,
                     unsigned int n) {
  const double d = n == 0 ? kNaN : BinomialInvCdf((1.0 - confidence) * 0.5, n, 0.5);
  // P(X <= k) of Binomial(n, 1/2); the point mass at d is F(d) - F(d-1).
  auto F = [n](double k) { return BinomialCdf(k, n, 0.5, false); };
  signLimits(lower, upper, confidence, sorted, n, d, F);
}

void ApproximateTwoSidedCI(double* lower, double* upper, double confidence, double const* sorted,
                           unsigned int n) {
  const double mean = 0.5 * n;
  const double sigma = 0.5 * std::sqrt(static_cast<double>(n));
  const double d =
      n == 0 ? kNaN : std::floor(NormalInvCdf((1.0 - confidence) * 0.5, mean, sigma) + 0.5);
  // Continuity-corrected normal approximation of P(X <= k).
  auto F = [mean, sigma](double k) { return NormalCdf(k + 0.5, mean, sigma, false); };
  signLimits(lower, upper, confidence, sorted, n, d, F);
}

int GetLynFiveNumberSummary(FiveNumberSummary* five, double const* x, unsigned int n) {
  double q[5];
  const int code = GetSampleQuantiles(x, n, 6, q, kFiveProbabilities, 5);
  if (code == qelOk) fillFive(five, q);
  return code;
}

int GetLyn2013ExtendedSummary(SecondSampleMoments* moments, FiveNumberSummary* five, double* modes,
                              unsigned int* modeCount, unsigned int* frequency, double const* x) {
  GetSecondSampleMoments(moments, x);
  const unsigned int n = moments->n;
  try {
    const std::vector<double> sorted = mSortedCopy(x, n);
    double q[5];
    GetType6SampleQuantiles(sorted.data(), n, q, kFiveProbabilities, 5);
    fillFive(five, q);
    *modeCount = ModeOnSorted(sorted.data(), n, modes, kModeRoom, frequency);
  } catch (std::bad_alloc const&) {
    *five = FiveNumberSummary();
    ResetMode(modes, kModeRoom, modeCount, frequency);
    return qelFailOutOfMemory;
  }
  return qelOk;
}

int RunLynBoxplotHelper(LynBoxplotHelper* box, double confidence, double const* x, unsigned int n) {
  LynBoxplotHelper result;
  try {
    const std::vector<double> sorted = mSortedCopy(x, n);
    const double* s = sorted.data();
    if (n > 0) {
      const double p = (3.0 + n) / (4.0 * (n + 1.0));
      result.minimum = s[0];
      result.maximum = s[n - 1];
      result.firstQuartile = depthValue(s, n, 0.25);
      result.median = depthValue(s, n, 0.5);
      result.thirdQuartile = depthValue(s, n, 0.75);
      result.lowerHinge = depthValue(s, n, p);
      result.upperHinge = depthValue(s, n, 1.0 - p);
    }
    if (n > 50) {
      ApproximateTwoSidedCI(&result.medianLowerLimit, &result.medianUpperLimit, confidence, s, n);
    } else {
      ExactTwoSidedCI(&result.medianLowerLimit, &result.medianUpperLimit, confidence, s, n);
    }
    double variance = kNaN;
    GetSampleMeanAndVariance(x, n, &result.mean, &variance);
    result.standardDeviation = std::sqrt(variance);
  } catch (std::bad_alloc const&) {
    *box = LynBoxplotHelper();
    return qelFailOutOfMemory;
  }
  *box = result;
  return qelOk;
}

}  // namespace v1
}  // namespace qel
