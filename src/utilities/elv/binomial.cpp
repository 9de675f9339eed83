// Binomial distribution with n trials: both tails, each to full relative
// accuracy, the mass, and the quantiles with their randomisation fraction.
//
// The smaller tail is the mass at k times a scaled sum of mass ratios
//   P(X = k-1)/P(X = k) = k (1-p) / ((n-k+1) p),
//   P(X = k+1)/P(X = k) = (n-k) p / ((k+1) (1-p)),
// summed smallest term first. For p above 1/2 the count of failures, whose
// probability is below 1/2, is used instead. The mass comes from the
// saddle-point form of lnpbinomial, so that it stays accurate for n up to
// 9.5e7; tails too small for a double are an exact 0 with code 1.
#include <qel/elv.h>

#include <cmath>
#include <utility>

#include "utilities/elv/limits.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

constexpr int kQuantileSteps = 40;
// Failure index of the quantile routines.
constexpr long kFailedIndex = 94906265;

// The two passes of a scaled sum 1 + t1 + t1 t2 + ...: the forward pass
// fixes the number of terms (at most `available`), the backward pass adds
// them smallest first.
template <class Ratio>
int scaledSum(const char* name, long available, double* out, Ratio ratio) {
  double term = 1.0;
  long n = 0;
  while (n < available && term >= seriesCutoff()) {
    if (n + 1 >= kMaxCount) {
      ELVsteps1 = 0;
      ELVexit(name, 4, 'F');
      return 4;
    }
    ++n;
    term *= ratio(n);
  }
  double sum = 1.0;
  for (long j = n; j >= 1; --j) sum = 1.0 + ratio(j) * sum;
  *out = sum;
  ELVsteps1 = n;
  ELVexit(name, 0, 'N');
  return 0;
}

bool quantileArgumentsRefused(long n, double p, double prob) {
  return anyNan(p, prob) || p < kMinQuantileP || p > kMaxQuantileP || n < 1 ||
         n > static_cast<long>(kMaxShape) || prob < 0.0 || prob > 1.0;
}

// Cornish-Fisher approximation of the quantile with normal deviate z.
double cornishFisher(long n, double prob, double z) {
  const double mean = n * prob;
  const double sd = std::sqrt(mean * (1.0 - prob));
  return std::floor(mean + sd * z - 0.5 + (1.0 - 2.0 * prob) * (z * z - 1.0) / 6.0);
}

// Largest k with P(X > k) <= p, prob at most 1/2. Returns the code.
int upperQuantile(long n, double p, double prob, long* k, double* f) {
  const double mean = n * prob;
  long start;
  if (mean < 1e-6) {
    start = n < 1 ? n : 1;
  } else if (mean < 0.001) {
    start = n < 3 ? n : 3;
  } else {
    double z;
    normal_upper_quant(p, &z);
    const double guess = cornishFisher(n, prob, z) + 2.0;
    start = guess > static_cast<double>(n) ? n : (guess < 0.0 ? 0 : static_cast<long>(guess));
  }
  double lower, upper, mass;
  binomial_df(start, n, prob, &lower, &upper, &mass);
  if (qel::elv::threadStatus() >= 2) return 4;
  double r = p - upper;
  if (r < 0.0) return 4;  // the start lies below the quantile
  const double q = 1.0 - prob;
  long j = start;
  int steps = 0;
  while (r >= mass && steps < kQuantileSteps && j > 0) {
    r -= mass;
    mass *= j * q / ((n - j + 1.0) * prob);
    --j;
    ++steps;
  }
  ELVsteps1 = steps;
  if (r > mass || !(mass > 0.0)) return 4;
  *k = j;
  *f = r / mass;
  return 0;
}

// Smallest k with P(X <= k) > p, prob at most 1/2. Returns the code.
int lowerQuantile(long n, double p, double prob, long* k, double* f) {
  const double mean = n * prob;
  const double q = 1.0 - prob;
  long j = 0;
  if (mean > 36.0) {
    double z;
    normal_upper_quant(p, &z);
    const double guess = cornishFisher(n, prob, -z);
    j = guess < 0.0 ? 0 : static_cast<long>(guess);
  }
  double below = 0.0, mass, lower, upper;
  if (j == 0) {
    binomial_df(0, n, prob, &lower, &upper, &mass);
    if (qel::elv::threadStatus() >= 2) return 4;
  } else {
    binomial_df(j - 1, n, prob, &below, &upper, &mass);
    if (qel::elv::threadStatus() >= 2) return 4;
    mass *= (n - j + 1.0) / j * (prob / q);
  }
  double r = p - below;
  if (r < 0.0) return 4;  // the start lies above the quantile
  int steps = 0;
  while (r >= mass && steps < kQuantileSteps && j < n) {
    r -= mass;
    mass *= (n - j) / (j + 1.0) * (prob / q);
    ++j;
    ++steps;
  }
  ELVsteps1 = steps;
  if (r >= mass || !(mass > 0.0)) return 4;
  *k = j;
  *f = r / mass;
  return 0;
}

// Shared frame of the two quantile routines; `upperForm` selects the form.
void binomialQuantile(const char* name, bool upperForm, long n, double p, double prob, long* k,
                      double* f) {
  ELVstartup(name);
  if (quantileArgumentsRefused(n, p, prob)) {
    *k = kFailedIndex;
    ELVexit(name, 2, 'F');
    return;
  }
  if (prob == 0.0 || prob == 1.0) {
    *k = prob == 0.0 ? 0 : n;
    *f = p;
    ELVmethod = prob == 0.0 ? 1 : 2;
    ELVexit(name, 0, 'F');
    return;
  }
  // Above 1/2 the count of failures n - X is used: the upper form for X is
  // the lower form for n - X, with the same fraction.
  const bool reflected = prob > 0.5;
  const bool upperSide = upperForm != reflected;
  const double used = reflected ? 1.0 - prob : prob;
  long index = 0;
  const int code =
      upperSide ? upperQuantile(n, p, used, &index, f) : lowerQuantile(n, p, used, &index, f);
  ELVmethod = upperSide ? 4 : 3;
  if (code != 0) {
    ELVexit(name, code, 'F');
    return;
  }
  *k = reflected ? n - index : index;
  ELVexit(name, 0, 'F');
}

}  // namespace

extern "C" {

// P(X > k)/P(X = k) = t1 (1 + t2 + t2 t3 + ...) with
// t(j) = (n-k-j+1) p / ((k+j) (1-p)).
int binomial_Ik(long k, long n, double* out, double prob) {
  const double y = prob / (1.0 - prob);
  const auto ratio = [=](long j) { return (n - k - j + 1.0) / (k + static_cast<double>(j)) * y; };
  double rest;
  const int code = scaledSum("binomial_Ik", n - k - 1, &rest, [=](long j) { return ratio(j + 1); });
  if (code == 0) *out = ratio(1) * rest;
  return code;
}

// P(X <= k)/P(X = k) = 1 + t1 + t1 t2 + ... with t(j) = (k-j+1) (1-p) / ((n-k+j) p).
int binomial_Jk(long k, long n, double* out, double prob) {
  const double y = (1.0 - prob) / prob;
  return scaledSum("binomial_Jk", k, out,
                   [=](long j) { return (k - j + 1.0) / (n - k + static_cast<double>(j)) * y; });
}

void binomial_df(long k, long n, double prob, double* lower, double* upper, double* mass) {
  static const char* const name = "binomial_df";
  ELVstartup(name);
  ELVsteps1 = 0;
  if (isNan(prob) || n < 0 || n >= kMaxCount || k < 0 || k > n || prob < 0.0 || prob > 1.0) {
    ELVmethod = 100;
    ELVexit(name, 2, 'F');
    return;
  }
  if (n == 0 || prob == 0.0 || prob == 1.0) {
    // All mass at 0 (n = 0 or prob = 0) or at n (prob = 1).
    const long at = prob == 1.0 ? n : 0;
    *mass = k == at ? 1.0 : 0.0;
    *lower = k >= at ? 1.0 : 0.0;
    *upper = 1.0 - *lower;
    ELVmethod = n == 0 ? 1 : (prob == 0.0 ? 2 : 3);
    ELVexit(name, 0, 'F');
    return;
  }
  ELVmethod = 100;
  double lm;
  lnpbinomial(static_cast<double>(k), static_cast<double>(n), &lm, prob);
  *mass = expOrZero(lm);
  if (k == n) {
    *lower = 1.0;
    *upper = 0.0;
    ELVmethod = 4;
    ELVexit(name, 0, 'F');
    return;
  }
  // Above 1/2: count failures. P(X <= k) = P(n-X > n-k-1); the mass needed
  // is that of the cell k+1.
  const bool reflected = prob > 0.5;
  double cellMass = *mass;
  if (reflected) {
    const double factor = (n - k) * prob / ((k + 1.0) * (1.0 - prob));
    cellMass *= factor;
    lm += std::log(factor);
    k = n - k - 1;
    prob = 1.0 - prob;
    ELVmethod += 100;
  }
  const double q = 1.0 - prob;
  const double m = (n + 1.0) * prob;
  int code = 0;
  double lo = 0.0, up = 0.0;
  double S;
  if (m - 1.0 >= k) {
    const double r = k / (n - k + 1.0) * (q / prob);
    if (lm >= underflowLog()) {
      if (binomial_Jk(k, n, &S, prob) != 0) goto seriesFailure;
      lo = cellMass * S;
      ELVmethod += 10;
    } else if (lm - std::log1p(-r) < underflowLog()) {
      code = 1;
      ELVmethod += 11;
    } else {
      if (binomial_Jk(k, n, &S, prob) != 0) goto seriesFailure;
      if (std::log(S) + lm < underflowLog()) {
        code = 1;
        ELVmethod += 12;
      } else {
        lo = std::exp(std::log(S) + lm);
        ELVmethod += 13;
      }
    }
    up = 1.0 - lo;
  } else {
    // ln r by sums of logarithms: r itself may lie below the normal doubles,
    // which the armed state reads as 0.
    const double logR = std::log((n - k) / (k + 1.0)) + std::log(prob) - std::log(q);
    const double r = std::exp(logR < underflowLog() ? underflowLog() : logR);
    if (lm >= underflowLog()) {
      if (binomial_Ik(k, n, &S, prob) != 0) goto seriesFailure;
      up = cellMass * S;
      ELVmethod += 20;
    } else if (lm + logR - std::log1p(-r) < underflowLog()) {
      code = 1;
      ELVmethod += 21;
    } else {
      if (binomial_Ik(k, n, &S, prob) != 0) goto seriesFailure;
      if (std::log(S) + lm < underflowLog()) {
        code = 1;
        ELVmethod += 22;
      } else {
        up = std::exp(std::log(S) + lm);
        ELVmethod += 23;
      }
    }
    lo = 1.0 - up;
  }
  *lower = reflected ? up : lo;
  *upper = reflected ? lo : up;
  ELVexit(name, code, 'F');
  return;

seriesFailure:
  ELVexit(name, 4, 'N');
}

void binomial_upper_quant(long n, double p, double prob, long* k, double* f) {
  binomialQuantile("binomial_upper_quant", true, n, p, prob, k, f);
}

void binomial_lower_quant(long n, double p, double prob, long* k, double* f) {
  binomialQuantile("binomial_lower_quant", false, n, p, prob, k, f);
}

}  // extern "C"
