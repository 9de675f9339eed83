// The chi-square and Bonett (2006) limits of one variance, and Bonett's
// kurtosis estimate with its trimmed mean.
#include "interfaces/basic_statistics/utilities_variance.h"

#include <qel/distributions.h>
#include <qel/order_statistics.h>

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <limits>
#include <new>
#include <vector>

#include "interfaces/math/random_distributions_v0.h"

namespace qel {

namespace v1 {

double CalcTrimmedKurtosis(double const* x, double variance, unsigned int n, int* status) {
  *status = qelOk;
  const double nd = n;
  const double trim = n > 5 ? 1.0 / (2.0 * std::sqrt(nd - 4.0)) : 0.0;
  try {
    // The trimmed mean reads the two partly dropped order statistics and the
    // ones between them in any order: two selections (Hoare's FIND, as
    // std::nth_element) place them in O(n) where a sort would take n log n.
    std::vector<double> part(x, x + n);
    const double whole = std::trunc(nd * trim);
    if (n > 0 && 2.0 * whole < nd) {
      const auto g = static_cast<std::ptrdiff_t>(whole);
      std::nth_element(part.begin(), part.begin() + g, part.end());
      std::nth_element(part.begin() + g + 1, part.end() - 1 - g, part.end());
    }
    const double m = LynTrimmedMeanOnSorted(part.data(), n, trim);
    const double sd =
        variance >= 0.0 ? std::sqrt(variance) : std::numeric_limits<double>::quiet_NaN();
    double sum = 0.0;
    for (double v : part) {
      const double u = (v - m) / sd;
      const double u2 = u * u;
      sum += u2 * u2;
    }
    return nd / ((nd - 1.0) * (nd - 1.0)) * sum;
  } catch (const std::bad_alloc&) {
    *status = qelFailOutOfMemory;
    return std::numeric_limits<double>::quiet_NaN();
  }
}

}  // namespace v1

namespace v0 {

namespace {
const double kNaN = std::numeric_limits<double>::quiet_NaN();
const double kInfinity = std::numeric_limits<double>::infinity();
}  // namespace

namespace {
bool anyNaN(double a, double b, double c = 0.0) {
  return std::isnan(a) || std::isnan(b) || std::isnan(c);
}
}  // namespace

double ChiSqQuantile(double p, double df) {
  return anyNaN(p, df) ? kNaN : ChiSqInvCdf(p, df, 0.0);
}

double FQuantile(double p, double df1, double df2) {
  return anyNaN(p, df1, df2) ? kNaN : FInvCdf(p, df1, df2, 0.0);
}

double ChiSqTailPValue(double x, double df, AlternativeHypothesis alternative) {
  return anyNaN(x, df) ? kNaN : ChiSqPValue(x, df, alternative);
}

double FTailPValue(double x, double df1, double df2, AlternativeHypothesis alternative) {
  return anyNaN(x, df1, df2) ? kNaN : FPValue(x, df1, df2, alternative);
}

bool IsKnownAlternative(AlternativeHypothesis alternative) {
  return alternative == kAlternativeLess || alternative == kAlternativeNotEqual ||
         alternative == kAlternativeGreater;
}

bool IsKnownIntervalType(IntervalType type) {
  return type == kIntervalUpperBound || type == kIntervalTwoSided || type == kIntervalLowerBound;
}

int PerformChiSquareMethod(double* lower, double* upper, double variance, double df,
                           double confidence, IntervalType type) {
  const double s = variance * df;
  switch (type) {
    case kIntervalTwoSided:
      *lower = s / ChiSqQuantile((confidence + 1.0) * 0.5, df);
      *upper = s / ChiSqQuantile((1.0 - confidence) * 0.5, df);
      return qelOk;
    case kIntervalLowerBound:
      *lower = s / ChiSqQuantile(confidence, df);
      *upper = kInfinity;
      return qelOk;
    case kIntervalUpperBound:
      *lower = 0.0;
      *upper = s / ChiSqQuantile(1.0 - confidence, df);
      return qelOk;
  }
  *lower = kNaN;
  *upper = kNaN;
  return qelFailBadEnumValue;
}

// Bonett's interval exp(ln(f s^2) -/+ z f sqrt(c / (n - 1))) with
// f = n / (n - z) and c = kurtosis - (n - 3) / n.
int PerformBonettMethod(double* lower, double* upper, double* varianceThenKurtosis,
                        double confidence, double const* x, unsigned int n, IntervalType type) {
  *lower = kNaN;
  *upper = kNaN;
  if (!IsKnownIntervalType(type)) return qelFailBadEnumValue;
  const double s2 = *varianceThenKurtosis;
  double k = 1.0;
  if (s2 > 0.0) {
    int status = qelOk;
    k = v1::CalcTrimmedKurtosis(x, s2, n, &status);
    if (status != qelOk) {
      *varianceThenKurtosis = kNaN;
      return status;
    }
  }
  *varianceThenKurtosis = k;
  const double nd = n;
  const double c = k + 3.0 / nd - 1.0;
  if (!(c > 0.0 && c < kInfinity)) return qelOk;
  const double p = type == kIntervalTwoSided ? (confidence + 1.0) * 0.5 : confidence;
  const double z = NormalInvCdf(p, 0.0, 1.0);
  if (!(z < nd)) return qelOk;
  const double f = nd / (nd - z);
  const double exponent = z * f * std::sqrt(c / (nd - 1.0));
  // Beyond about 709 the factor is infinite: the limits go to 0 and infinity.
  const double w = exponent > 709.0 ? kInfinity : std::exp(exponent);
  *lower = type == kIntervalUpperBound ? 0.0 : f * s2 / w;
  *upper = type == kIntervalLowerBound ? kInfinity : f * s2 * w;
  return qelOk;
}

}  // namespace v0
}  // namespace qel
