// Hypergeometric distribution for the ELV routines: population N with M
// marked items, a sample of n, X the number of marked items in the sample;
// lower = P(X <= k), upper = P(X > k). The mass comes from the stable
// logarithm lnphyper; the tail on the far side of the mode from k is summed
// as the mass times a series of products of the cell ratios
//   P(X = i)/P(X = i-1) = (M-i+1)(n-i+1) / (i (N-M-n+i)),
// and the other tail is its complement. Symmetries bring the sample and the
// marked fraction to at most half the population first, which keeps the
// direct tail the short one. The quantiles are randomised: they return k and
// the fraction f of the mass at k that makes up p exactly.
#include <qel/elv.h>

#include <algorithm>
#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

const char* const kDfName = "hypergeo_df";
constexpr long kSeriesCap = 100001;
constexpr int kQuantileSteps = 40;
constexpr unsigned long kQuantileFailure = 94906265UL;

// P(X = i)/P(X = i-1), all counts as doubles so that N-M-n+i never wraps.
double upRatio(double i, double N, double M, double n) {
  return (M - i + 1.0) * (n - i + 1.0) / (i * (N - M - n + i));
}

// P(X = i-1)/P(X = i).
double downRatio(double i, double N, double M, double n) {
  return (N - M - n + i) * i / ((M - i + 1.0) * (n - i + 1.0));
}

void setOutputs(double* lower, double* upper, double* mass, double l, double u, double m) {
  *lower = l;
  *upper = u;
  *mass = m;
}

// The tail on the side of k away from the mode, by hyper_Ik (above k) or
// hyper_Jk (k and below), with the logarithm fallback for a mass that
// underflows. Returns the direct tail, 0 with code 1 when it underflows.
struct DirectTail {
  double value = 0.0;
  int code = 0;  // 0, 1 or 4
  int method = 0;
};

DirectTail directTail(bool above, unsigned long k, unsigned long N, unsigned long M,
                      unsigned long n, double lm, double mass) {
  const double dk = static_cast<double>(k), dN = static_cast<double>(N),
               dM = static_cast<double>(M), dn = static_cast<double>(n);
  DirectTail tail;
  const int base = above ? 20 : 10;
  double series = 0.0;
  auto runSeries = [&]() {
    return above ? hyper_Ik(k, N, M, n, &series) : hyper_Jk(k, N, M, n, &series);
  };
  if (lm >= underflowLog()) {
    if (runSeries() != 0) return DirectTail{-1.0, 4, base};
    tail.value = mass * series;
    tail.method = base;
    return tail;
  }
  // Geometric bound of the tail: the first ratio r away from k gives a tail
  // of at most mass r/(1-r) above k, or mass/(1-r') for k and below.
  // Beyond the mode 0 <= r < 1; r = 0 (k at the end of the support below)
  // leaves the mass at k alone.
  const double r = above ? upRatio(dk + 1.0, dN, dM, dn) : downRatio(dk, dN, dM, dn);
  double bound = lm;
  if (r > 0.0 && r < 1.0) bound = above ? lm + std::log(r / (1.0 - r)) : lm - std::log1p(-r);
  if (bound < underflowLog()) return DirectTail{0.0, 1, base + 1};
  if (runSeries() != 0) return DirectTail{-1.0, 4, base + 1};
  const double logTail = std::log(series) + lm;
  if (logTail < underflowLog()) return DirectTail{0.0, 1, base + 2};
  return DirectTail{std::exp(logTail), 0, base + 3};
}

bool quantileArgumentsValid(unsigned long N, unsigned long M, unsigned long n, double p) {
  return N >= 2 && N <= static_cast<unsigned long>(kMaxShape) && M >= 1 && M <= N - 1 && n >= 1 &&
         n <= N - 1 && !isNan(p) && p >= kMinQuantileP && p <= kMaxQuantileP;
}

// A start beyond the target or a search that did not reach it.
void quantileFailed(const char* name) {
  ELVexit(name, 4, 'F');
}

// Start of the quantile search: the Cornish-Fisher expansion with the
// skewness term of the hypergeometric law.
struct QuantileStart {
  double mean, sd, skew, z;
  double expansion(double zz) const { return mean + sd * zz - 0.5 + skew * (zz * zz - 1.0) / 6.0; }
};

QuantileStart quantileStart(unsigned long N, unsigned long M, unsigned long n, double p) {
  const double s = static_cast<double>(M) / static_cast<double>(N);
  const double t = static_cast<double>(n) / static_cast<double>(N);
  QuantileStart start;
  start.mean = static_cast<double>(n) * s;
  start.sd = std::sqrt(static_cast<double>(N) * s * (1.0 - s) * t * (1.0 - t));
  start.skew = (1.0 - 2.0 * s) * (1.0 - 2.0 * t);
  normal_upper_quant(p, &start.z);
  return start;
}

}  // namespace

extern "C" {

int hyper_Ik(unsigned long k, unsigned long N, unsigned long M, unsigned long n, double* out) {
  const double dN = static_cast<double>(N), dM = static_cast<double>(M),
               dn = static_cast<double>(n);
  // Forward pass: the number of terms until one falls below the cut-off.
  double term = 1.0, i = static_cast<double>(k);
  long length = 0;
  while (term >= seriesCutoff()) {
    if (length >= kSeriesCap) {
      *out = -1.0;
      ELVexit("hyper_Ik", 4, 'F');
      return 4;
    }
    i += 1.0;
    const double ratio = i > std::min(dM, dn) ? 0.0 : upRatio(i, dN, dM, dn);
    term *= ratio;
    ++length;
  }
  // Backward pass: s = r(k+1)(1 + r(k+2)(1 + ...)).
  double s = 0.0;
  for (long j = length; j >= 1; --j) {
    const double at = static_cast<double>(k) + static_cast<double>(j);
    const double ratio = at > std::min(dM, dn) ? 0.0 : upRatio(at, dN, dM, dn);
    s = (s + 1.0) * ratio;
  }
  ELVsteps1 = length;
  *out = s;
  ELVexit("hyper_Ik", 0, 'N');
  return 0;
}

int hyper_Jk(unsigned long k, unsigned long N, unsigned long M, unsigned long n, double* out) {
  const double dN = static_cast<double>(N), dM = static_cast<double>(M),
               dn = static_cast<double>(n);
  const double lowest = std::max(0.0, dn - (dN - dM));
  double term = 1.0, i = static_cast<double>(k) + 1.0;
  long length = 0;
  while (term >= seriesCutoff()) {
    if (length >= kSeriesCap) {
      *out = -1.0;
      ELVexit("hyper_Jk", 4, 'F');
      return 4;
    }
    i -= 1.0;
    const double ratio = i <= lowest ? 0.0 : downRatio(i, dN, dM, dn);
    term *= ratio;
    ++length;
  }
  // Horner form: s = 1 + r(k)(1 + r(k-1)(1 + ...)).
  double s = 1.0;
  for (long j = length - 1; j >= 0; --j) {
    const double at = static_cast<double>(k) - static_cast<double>(j);
    const double ratio = at <= lowest ? 0.0 : downRatio(at, dN, dM, dn);
    s = s * ratio + 1.0;
  }
  ELVsteps1 = length;
  *out = s;
  ELVexit("hyper_Jk", 0, 'N');
  return 0;
}

void hyper_intern(unsigned long k, unsigned long N, unsigned long M, unsigned long n, double* lower,
                  double* upper, double* mass) {
  const unsigned long top = std::min(n, M);
  if (k > top) {
    setOutputs(lower, upper, mass, 1.0, 0.0, 0.0);
    ELVmethod += 5;
    ELVexit(kDfName, 0, 'F');
    return;
  }
  const double dk = static_cast<double>(k), dN = static_cast<double>(N),
               dM = static_cast<double>(M), dn = static_cast<double>(n);
  double lm;
  lnphyper(dk, dN, dM, dn, &lm);
  *mass = expOrZero(lm);
  if (k == top) {
    *lower = 1.0;
    *upper = 0.0;
    ELVmethod += 6;
    ELVexit(kDfName, 0, 'F');
    return;
  }
  const double mode = (dn + 1.0) * (dM + 1.0) / (dN + 2.0) - 1.0;
  const bool above = mode < dk;
  const DirectTail tail = directTail(above, k, N, M, n, lm, *mass);
  ELVmethod += tail.method;
  if (tail.code == 4) {
    ELVexit(kDfName, 4, 'N');
    return;
  }
  if (above) {
    *upper = tail.value;
    *lower = 1.0 - tail.value;
  } else {
    *lower = tail.value;
    *upper = 1.0 - tail.value;
  }
  ELVexit(kDfName, tail.code, 'F');
}

void hypergeo_df(unsigned long k, unsigned long N, unsigned long M, unsigned long n, double* lower,
                 double* upper, double* mass) {
  ELVstartup(kDfName);
  ELVmethod = 0;
  if (N < 2 || N > static_cast<unsigned long>(kMaxShape) || M > N || n > N || k > n ||
      n - k > N - M || k > M) {
    ELVexit(kDfName, 2, 'F');
    return;
  }
  // Degenerate laws: the whole mass sits on one point.
  const auto trivial = [&](bool atPoint, int method) {
    if (atPoint)
      setOutputs(lower, upper, mass, 1.0, 0.0, 1.0);
    else
      setOutputs(lower, upper, mass, 0.0, 1.0, 0.0);
    ELVsteps1 = 0;
    ELVmethod = method;
    ELVexit(kDfName, 0, 'F');
  };
  if (n == 0) return trivial(true, 1);
  if (n == N) return trivial(k == M, 2);
  if (M == 0) return trivial(true, 3);
  if (M == N) return trivial(k == n, 4);

  if (k == std::min(n, M)) {
    ELVmethod = 100;
    hyper_intern(k, N, M, n, lower, upper, mass);
    return;
  }
  const bool smallSample = 2 * n <= N;  // t = n/N at most 0.5
  const bool fewMarked = 2 * M <= N;    // s = M/N at most 0.5
  const double dk = static_cast<double>(k);
  // From the mass of the cell k+1 to that of k.
  const double factor =
      (dk + static_cast<double>(N) - static_cast<double>(M) - static_cast<double>(n) + 1.0) *
      (dk + 1.0) / ((static_cast<double>(n) - dk) * (static_cast<double>(M) - dk));
  double neighbour = 0.0;
  if (smallSample && fewMarked) {
    ELVmethod = 100;
    hyper_intern(k, N, M, n, lower, upper, mass);
  } else if (smallSample) {
    // n - X counts unmarked items: P(X <= k) = P(n - X > n-k-1).
    ELVmethod = 200;
    hyper_intern(n - k - 1, N, N - M, n, upper, lower, &neighbour);
    *mass = neighbour > 0.0 ? neighbour * factor : neighbour;
  } else if (fewMarked) {
    // Roles of sample and marked items exchanged, then the unsampled ones.
    ELVmethod = 300;
    hyper_intern(M - k - 1, N, N - n, M, upper, lower, &neighbour);
    *mass = neighbour > 0.0 ? neighbour * factor : neighbour;
  } else {
    ELVmethod = 400;
    hyper_intern(k + N - M - n, N, N - n, N - M, lower, upper, mass);
  }
}

void hypergeo_lower_quant(unsigned long N, unsigned long M, unsigned long n, unsigned long* k,
                          double* f, double p) {
  static const char* const name = "hypergeo_lower_quant";
  ELVstartup(name);
  if (!quantileArgumentsValid(N, M, n, p)) {
    *k = kQuantileFailure;
    ELVexit(name, 2, 'F');
    return;
  }
  // Reflections onto M <= N-M and n <= N-n (n - X, M - X or the unmarked
  // unsampled count are hypergeometric too).
  if (M > N - M && n <= N - n) {
    hypergeo_upper_quant(N, N - M, n, k, f, p);
    if (qel::elv::threadStatus() < 2) *k = n - *k;
    return;
  }
  if (M > N - M) {
    hypergeo_lower_quant(N, N - M, N - n, k, f, p);
    if (qel::elv::threadStatus() < 2) *k = M - N + n + *k;
    return;
  }
  if (n > N - n) {
    hypergeo_upper_quant(N, M, N - n, k, f, p);
    if (qel::elv::threadStatus() < 2) *k = M - *k;
    return;
  }
  const QuantileStart start = quantileStart(N, M, n, p);
  const double dN = static_cast<double>(N), dM = static_cast<double>(M),
               dn = static_cast<double>(n);
  double lower = 0.0, upper = 0.0, mass = 0.0, sum = 0.0;
  double kk = start.mean <= 36.0 ? 0.0 : std::floor(start.expansion(-start.z));
  if (kk < 1.0) {
    // No room below the start: begin with the mass at 0.
    kk = 0.0;
    hypergeo_df(0, N, M, n, &lower, &upper, &mass);
  } else {
    hypergeo_df(static_cast<unsigned long>(kk) - 1, N, M, n, &lower, &upper, &mass);
    sum = lower;
    mass *= upRatio(kk, dN, dM, dn);
  }
  if (qel::elv::threadStatus() >= 2) return quantileFailed(name);
  double remainder = p - sum;
  if (remainder < 0.0) return quantileFailed(name);
  int steps = 0;
  while (remainder >= mass && steps < kQuantileSteps) {
    remainder -= mass;
    kk += 1.0;
    mass *= upRatio(kk, dN, dM, dn);
    ++steps;
  }
  if (remainder >= mass) return quantileFailed(name);
  *k = static_cast<unsigned long>(kk);
  *f = remainder / mass;
  ELVsteps1 = steps;
  ELVmethod = 1;
  ELVexit(name, 0, 'N');
}

void hypergeo_upper_quant(unsigned long N, unsigned long M, unsigned long n, unsigned long* k,
                          double* f, double p) {
  static const char* const name = "hypergeo_upper_quant";
  ELVstartup(name);
  if (!quantileArgumentsValid(N, M, n, p)) {
    *k = kQuantileFailure;
    ELVexit(name, 2, 'F');
    return;
  }
  if (M > N - M && n <= N - n) {
    hypergeo_lower_quant(N, N - M, n, k, f, p);
    if (qel::elv::threadStatus() < 2) *k = n - *k;
    return;
  }
  if (M > N - M) {
    hypergeo_upper_quant(N, N - M, N - n, k, f, p);
    if (qel::elv::threadStatus() < 2) *k = M - N + n + *k;
    return;
  }
  if (n > N - n) {
    hypergeo_lower_quant(N, M, N - n, k, f, p);
    if (qel::elv::threadStatus() < 2) *k = M - *k;
    return;
  }
  const QuantileStart start = quantileStart(N, M, n, p);
  const double dN = static_cast<double>(N), dM = static_cast<double>(M),
               dn = static_cast<double>(n);
  const double top = std::min(dM, dn);
  double kk = std::min(std::max(0.0, std::floor(start.expansion(start.z)) + 2.0), top);
  if (start.mean < 1e-6)
    kk = std::min(top, 1.0);
  else if (start.mean < 0.001)
    kk = std::min(top, 3.0);
  double lower = 0.0, upper = 0.0, mass = 0.0;
  hypergeo_df(static_cast<unsigned long>(kk), N, M, n, &lower, &upper, &mass);
  if (qel::elv::threadStatus() >= 2) return quantileFailed(name);
  double remainder = p - upper;
  if (remainder < 0.0) return quantileFailed(name);
  int steps = 0;
  while (remainder >= mass && steps < kQuantileSteps && kk > 0.0) {
    remainder -= mass;
    mass *= downRatio(kk, dN, dM, dn);
    kk -= 1.0;
    ++steps;
  }
  if (remainder >= mass) return quantileFailed(name);
  *k = static_cast<unsigned long>(kk);
  *f = remainder / mass;
  ELVsteps1 = steps;
  ELVmethod = 2;
  ELVexit(name, 0, 'N');
}

}  // extern "C"
