// Central sums of powers up to four in one pass, and the sample skewness and
// kurtosis built on them.
//
// With d = x[k] - mean and e = d / (k+1), the central sums of the first k+1
// elements follow from those of the first k (Terriberry's updating form of
// Welford's recurrence; Pebay, Sandia report SAND2008-6212, eqs. 1.5-1.6):
//   M2 += k*e*d
//   M3 += ((k-1)*k*e*d - 3*M2) * e
//   M4 += ((k*k-k+1)*k*e*d*e + 6*M2*e - 4*M3) * e
// with the old M2 and M3 on the right. Each sum is compensated.
#include <qel/basic_types.h>

#include <cmath>
#include <cstdint>
#include <limits>

#include "interfaces/basic_statistics/utilities.h"

namespace qel {
namespace v1 {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr unsigned int kHighestOrder = 4;

struct CentralSums {
  double mean, m2, m3, m4;
};

// n >= 1.
CentralSums centralSums(double const* x, unsigned int n) {
  CompensatedSum mean(x[0]), m2, m3, m4;
  for (unsigned int k = 1; k < n; ++k) {
    const double d = x[k] - mean.sum;
    const double e = d / (1.0 + k);
    const double t = k * e * d;
    const double oldM2 = m2.sum;
    const double oldM3 = m3.sum;
    mean.add(e);
    m2.add(t);
    m3.add(((k - 1) * t - 3 * oldM2) * e);
    // k*k - k + 1 in 64 bits: in 32 it wraps from k = 65537 on.
    const std::uint64_t k64 = k;
    const double w = static_cast<double>(k64 * k64 - k64 + 1u);
    m4.add((w * t * e + 6 * oldM2 * e - 4 * oldM3) * e);
  }
  return {mean.sum, m2.sum, m3.sum, m4.sum};
}

}  // namespace

void GetCenteredOrder4PowerSums(double const* x, unsigned int n, double* out) {
  const CentralSums s = centralSums(x, n == 0 ? 1 : n);
  out[0] = s.mean;
  out[1] = s.m2;
  out[2] = s.m3;
  out[3] = s.m4;
}

int GetCenteredOrderKPowerSums(double const* x, unsigned int n, double* out, unsigned int k) {
  const unsigned int computed = k < kHighestOrder ? k : kHighestOrder;
  if (n >= 2) {
    const CentralSums s = centralSums(x, n);
    const double values[kHighestOrder] = {s.mean, s.m2, s.m3, s.m4};
    for (unsigned int i = 0; i < computed; ++i) out[i] = values[i];
  } else if (n == 1) {
    if (k > 0) out[0] = x[0];
    for (unsigned int i = 1; i < computed; ++i) out[i] = 0.0;
  } else {
    for (unsigned int i = 0; i < computed; ++i) out[i] = kNaN;
  }
  if (k <= kHighestOrder) return qelOk;
  // Orders above four are not computed; the lower four are still delivered.
  for (unsigned int i = kHighestOrder; i < k; ++i) out[i] = kNaN;
  return qelFailNotImplemented;
}

void GetLynSkewnessAndKurtosis(double const* x, unsigned int n, double* skewness,
                               double* kurtosis) {
  *skewness = kNaN;
  *kurtosis = kNaN;
  if (n < 3) return;
  const CentralSums s = centralSums(x, n);
  const double m = n;
  *skewness = (s.m3 / s.m2) * (m / (m - 2.0)) * std::sqrt((m - 1.0) / s.m2);
  if (n < 4) return;
  *kurtosis = ((m - 1.0) / ((m - 2.0) * (m - 3.0))) *
              (m * (m + 1.0) * (s.m4 / (s.m2 * s.m2)) - 3.0 * (m - 1.0));
}

}  // namespace v1
}  // namespace qel
