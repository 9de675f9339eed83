// Poisson distribution with mean m: lower = P(X <= k), upper = P(X > k) and
// the mass, each tail to full relative accuracy, and the quantiles with the
// fraction that splits the mass of the quantile point.
//
// The smaller tail is the mass times a scaled series of ratios of masses
// (terms start near 1, cut off at 1e-9), carried in logarithms so that an
// underflowing tail is reported as an exact 0 with code 1.
#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/mixture.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

constexpr int kQuantileSteps = 40;

}  // namespace

extern "C" {

// P(X > k)/P(X = k) = m/(k+1) + m^2/((k+1)(k+2)) + ...
int poisson_Ik(long k, double* out, double m) {
  double term = m / (k + 1.0);
  long n = 1;
  while (term >= seriesCutoff()) {
    if (n + 1 >= kMaxCount) {
      ELVsteps1 = 0;
      ELVexit("poisson_Ik", 4, 'F');
      return 4;
    }
    ++n;
    term *= m / (k + static_cast<double>(n));
  }
  double sum = 0.0;
  for (long j = n; j >= 1; --j) sum = (sum + 1.0) * m / (k + static_cast<double>(j));
  *out = sum;
  ELVsteps1 = n;
  ELVexit("poisson_Ik", 0, 'N');
  return 0;
}

// P(X <= k)/P(X = k) = 1 + k/m + k(k-1)/m^2 + ... (k terms at most).
int poisson_Jk(long k, double* out, double m) {
  double term = 1.0;
  long n = 0;
  while (n < k && term >= seriesCutoff()) {
    if (n + 1 >= kMaxCount) {
      ELVsteps1 = 0;
      ELVexit("poisson_Jk", 4, 'F');
      return 4;
    }
    ++n;
    term *= (k - n + 1.0) / m;
  }
  double sum = 1.0;
  for (long j = n; j >= 1; --j) sum = 1.0 + sum * (k - j + 1.0) / m;
  *out = sum;
  ELVsteps1 = n;
  ELVexit("poisson_Jk", 0, 'N');
  return 0;
}

void poisson_df(long k, double m, double* lower, double* upper, double* mass) {
  static const char* const name = "poisson_df";
  ELVstartup(name);
  if (isNan(m) || m < 0.0 || m > kMaxShape || k < 0 || k >= kMaxCount) {
    ELVexit(name, 2, 'F');
    return;
  }
  if (m == 0.0) {
    *lower = 1.0;
    *upper = 0.0;
    *mass = k == 0 ? 1.0 : 0.0;
    ELVmethod = 1;
    ELVsteps1 = 0;
    ELVexit(name, 0, 'F');
    return;
  }
  double lm;
  lnppoisson(static_cast<double>(k), &lm, m);
  *mass = expOrZero(lm);
  int code = 0;
  if (k > m - 1.0) {
    // Upper tail P(X > k) = mass I.
    double I;
    if (lm >= underflowLog()) {
      if (poisson_Ik(k, &I, m) != 0) goto seriesFailure;
      *upper = *mass * I;
      ELVmethod = 20;
    } else {
      // I is at most r/(1-r), r = m/(k+1): a bound decides underflow early.
      const double r = m / (k + 1.0);
      if (lm + std::log(r / (1.0 - r)) < underflowLog()) {
        *upper = 0.0;
        code = 1;
        ELVmethod = 21;
      } else {
        if (poisson_Ik(k, &I, m) != 0) goto seriesFailure;
        const double logUpper = std::log(I) + lm;
        if (logUpper < underflowLog()) {
          *upper = 0.0;
          code = 1;
          ELVmethod = 22;
        } else {
          *upper = std::exp(logUpper);
          ELVmethod = 23;
        }
      }
    }
    *lower = 1.0 - *upper;
  } else {
    // Lower tail P(X <= k) = mass J, J at most 1/(1 - k/m).
    double J;
    if (lm >= underflowLog()) {
      if (poisson_Jk(k, &J, m) != 0) goto seriesFailure;
      *lower = *mass * J;
      ELVmethod = 10;
    } else if (lm - std::log(1.0 - k / m) < underflowLog()) {
      *lower = 0.0;
      code = 1;
      ELVmethod = 11;
    } else {
      if (poisson_Jk(k, &J, m) != 0) goto seriesFailure;
      const double logLower = std::log(J) + lm;
      if (logLower < underflowLog()) {
        *lower = 0.0;
        code = 1;
        ELVmethod = 12;
      } else {
        *lower = std::exp(logLower);
        ELVmethod = 13;
      }
    }
    *upper = 1.0 - *lower;
  }
  ELVexit(name, code, 'F');
  return;

seriesFailure:
  ELVexit(name, 4, 'N');
}

}  // extern "C"

namespace {

bool quantileArgumentsRefused(double p, double m) {
  return anyNan(p, m) || m < 0.0 || m > kMaxShape || p < kMinQuantileP || p > kMaxQuantileP;
}

// Normal approximation with a skewness correction for the Poisson quantile
// at upper-tail deviate z (Cornish-Fisher, continuity corrected).
double poissonStart(double z, double m) {
  return std::floor(std::sqrt(m) * z + m - 0.5 + (z * z - 1.0) / 6.0);
}

}  // namespace

extern "C" {

// Largest k with P(X > k) <= p, and f = (p - P(X > k))/P(X = k).
void poisson_upper_quant(long* k, double* f, double p, double m) {
  ELVstartup("poisson_upper_quant");
  if (quantileArgumentsRefused(p, m)) {
    ELVexit("poisson_upper_quant", 2, 'F');
    return;
  }
  qel::elv::poissonUpperQuantile(k, f, p, m);
}

// Smallest k with P(X <= k) > p, and f = (p - P(X < k))/P(X = k).
void poisson_lower_quant(long* k, double* f, double p, double m) {
  ELVstartup("poisson_lower_quant");
  if (quantileArgumentsRefused(p, m)) {
    ELVexit("poisson_lower_quant", 2, 'F');
    return;
  }
  qel::elv::poissonLowerQuantile(k, f, p, m);
}

}  // extern "C"

namespace qel {
namespace elv {

// The quantile searches without the range check of the probability (the
// mixture sums ask for tails far below 1e-12); p must lie in (0, 0.5].
void poissonUpperQuantile(long* k, double* f, double p, double m) {
  static const char* const name = "poisson_upper_quant";
  double start;
  if (m < 5e-13) {
    start = 0.0;
  } else if (m < 1e-6) {
    start = 1.0;
  } else if (m < 0.001) {
    start = 3.0;
  } else {
    double z;
    normal_upper_quant(p, &z);
    start = poissonStart(z, m) + 2.0;
  }
  // The start lies above the quantile; it stays within the admissible range.
  if (start > kMaxCount - 1) start = kMaxCount - 1;
  long j = static_cast<long>(start);
  double lower, upper, mass;
  poisson_df(j, m, &lower, &upper, &mass);
  double r = p - upper;
  if (qel::elv::threadStatus() >= 2 || r < 0.0) {
    ELVexit(name, 4, 'F');
    return;
  }
  int steps = 0;
  while (steps < kQuantileSteps && r >= mass) {
    r -= mass;
    mass *= j / m;
    --j;
    ++steps;
  }
  if (r > mass || !(mass > 0.0)) {
    ELVexit(name, 4, 'F');
    return;
  }
  *k = j;
  *f = r / mass;
  ELVsteps1 = steps;
  ELVexit(name, 0, 'N');
}

void poissonLowerQuantile(long* k, double* f, double p, double m) {
  static const char* const name = "poisson_lower_quant";
  long j;
  double mass, r;
  if (m <= 36.0) {
    j = 0;
    mass = std::exp(-m);
    r = p;
  } else {
    double z;
    normal_upper_quant(p, &z);
    const double start = poissonStart(-z, m);
    // The start lies below the quantile; at least 1 so that k-1 is a count.
    j = start < 1.0 ? 1 : static_cast<long>(start);
    double lower, upper, massBefore;
    poisson_df(j - 1, m, &lower, &upper, &massBefore);
    mass = massBefore * m / j;
    r = p - lower;
    if (qel::elv::threadStatus() >= 2 || r < 0.0) {
      ELVexit(name, 4, 'F');
      return;
    }
  }
  int steps = 0;
  while (steps < kQuantileSteps && r >= mass) {
    r -= mass;
    ++j;
    mass *= m / j;
    ++steps;
  }
  if (r >= mass || !(mass > 0.0)) {
    ELVexit(name, 4, 'F');
    return;
  }
  *k = j;
  *f = r / mass;
  ELVsteps1 = steps;
  ELVexit(name, 0, 'N');
}

}  // namespace elv
}  // namespace qel
