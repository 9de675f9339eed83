// ELV normal, t, noncentral t and hypergeometric routines against Boost.Math
// on the same inputs: nanoseconds per call in the body and in the far tails,
// where each ELV routine computes the small tail in its own right while
// Boost forms some of them as complements. The far-tail benchmarks also
// report the relative error of both libraries at one point against the
// mpmath value in tests/data (written by tools/reference).
#include <benchmark/benchmark.h>
#include <qel/elv.h>

#include <boost/math/distributions/hypergeometric.hpp>
#include <boost/math/distributions/non_central_t.hpp>
#include <boost/math/distributions/normal.hpp>
#include <cmath>
#include <vector>

namespace {

constexpr int kPoints = 256;
// P(T <= -1) for df = 30, delta = 10, from tests/data/elv_t_noncentral.csv.
constexpr double kLowerFarReference = 5.316662946346313768e-28;

std::vector<double> grid(double from, double to) {
  std::vector<double> x(kPoints);
  for (int i = 0; i < kPoints; ++i) x[i] = from + (to - from) * (i + 0.5) / kPoints;
  return x;
}

std::vector<double> logGrid(double from, double to) {
  std::vector<double> x = grid(std::log10(from), std::log10(to));
  for (double& v : x) v = std::pow(10.0, v);
  return x;
}

double relErr(double got, double want) {
  return std::fabs(got - want) / std::fabs(want);
}

template <class F>
void perCall(benchmark::State& state, const std::vector<double>& x, F f) {
  double sink = 0.0;
  for (auto _ : state) {
    for (double v : x) sink += f(v);
    benchmark::DoNotOptimize(sink);
  }
  state.SetItemsProcessed(state.iterations() * x.size());
}

// Normal distribution function.
void QelNormalBody(benchmark::State& s) {
  perCall(s, grid(-3, 3), [](double x) {
    double l, u;
    normal_df(x, &l, &u);
    return l;
  });
}
void BoostNormalBody(benchmark::State& s) {
  const boost::math::normal n;
  perCall(s, grid(-3, 3), [&](double x) { return cdf(n, x); });
}
void QelNormalFarTail(benchmark::State& s) {
  perCall(s, grid(-37, -10), [](double x) {
    double l, u;
    normal_df(x, &l, &u);
    return l;
  });
  double l, u;
  normal_df(-35.0, &l, &u);
  s.counters["relerr@-35"] = relErr(l, 1.124910706472406244e-268);  // elv_normal.csv
}
void BoostNormalFarTail(benchmark::State& s) {
  const boost::math::normal n;
  perCall(s, grid(-37, -10), [&](double x) { return cdf(n, x); });
  s.counters["relerr@-35"] = relErr(cdf(n, -35.0), 1.124910706472406244e-268);
}

// Normal quantile.
void QelInvNormalBody(benchmark::State& s) {
  perCall(s, grid(0.01, 0.99), [](double p) {
    double z;
    inv_normal_df(p, &z);
    return z;
  });
}
void BoostInvNormalBody(benchmark::State& s) {
  const boost::math::normal n;
  perCall(s, grid(0.01, 0.99), [&](double p) { return quantile(n, p); });
}
void QelInvNormalFarTail(benchmark::State& s) {
  perCall(s, logGrid(1e-100, 1e-20), [](double p) {
    double z;
    inv_normal_df(p, &z);
    return z;
  });
}
void BoostInvNormalFarTail(benchmark::State& s) {
  const boost::math::normal n;
  perCall(s, logGrid(1e-100, 1e-20), [&](double p) { return quantile(n, p); });
}

// t distribution function: central, noncentral body and far tails.
double qelT(double t, double df, double delta, bool upper) {
  double l, u;
  t_ncdf(t, df, delta, &l, &u);
  return upper ? u : l;
}
void QelTCentral(benchmark::State& s) {
  perCall(s, grid(-5, 5), [](double t) { return qelT(t, 10.0, 0.0, false); });
}
void BoostTCentral(benchmark::State& s) {
  const boost::math::non_central_t d(10.0, 0.0);
  perCall(s, grid(-5, 5), [&](double t) { return cdf(d, t); });
}
void QelTNoncentralBody(benchmark::State& s) {
  perCall(s, grid(-2, 6), [](double t) { return qelT(t, 10.0, 2.0, false); });
}
void BoostTNoncentralBody(benchmark::State& s) {
  const boost::math::non_central_t d(10.0, 2.0);
  perCall(s, grid(-2, 6), [&](double t) { return cdf(d, t); });
}
// Upper tail far beyond the centre (t delta > 0).
void QelTNoncentralUpperFar(benchmark::State& s) {
  perCall(s, grid(50, 100), [](double t) { return qelT(t, 10.0, 2.0, true); });
}
void BoostTNoncentralUpperFar(benchmark::State& s) {
  const boost::math::non_central_t d(10.0, 2.0);
  perCall(s, grid(50, 100), [&](double t) { return cdf(complement(d, t)); });
}
// Lower tail with t delta < 0: cancellation in the mixture.
void QelTNoncentralLowerFar(benchmark::State& s) {
  perCall(s, grid(-3, -1), [](double t) { return qelT(t, 30.0, 10.0, false); });
  s.counters["relerr"] = relErr(qelT(-1.0, 30.0, 10.0, false), kLowerFarReference);
}
void BoostTNoncentralLowerFar(benchmark::State& s) {
  const boost::math::non_central_t d(30.0, 10.0);
  perCall(s, grid(-3, -1), [&](double t) { return cdf(d, t); });
  s.counters["relerr"] = relErr(cdf(d, -1.0), kLowerFarReference);
}

// Hypergeometric distribution function.
void QelHypergeoBody(benchmark::State& s) {
  perCall(s, grid(40, 80), [](double k) {
    double l, u, m;
    hypergeo_df(static_cast<unsigned long>(k), 1000, 300, 200, &l, &u, &m);
    return l;
  });
}
void BoostHypergeoBody(benchmark::State& s) {
  const boost::math::hypergeometric_distribution<double> h(300, 200, 1000);
  perCall(s, grid(40, 80), [&](double k) { return cdf(h, static_cast<unsigned>(k)); });
}
void QelHypergeoLarge(benchmark::State& s) {
  perCall(s, grid(4990, 5010), [](double k) {
    double l, u, m;
    hypergeo_df(static_cast<unsigned long>(k), 100000, 50000, 10000, &l, &u, &m);
    return l;
  });
}
void BoostHypergeoLarge(benchmark::State& s) {
  const boost::math::hypergeometric_distribution<double> h(50000, 10000, 100000);
  perCall(s, grid(4990, 5010), [&](double k) { return cdf(h, static_cast<unsigned>(k)); });
}

}  // namespace

BENCHMARK(QelNormalBody);
BENCHMARK(BoostNormalBody);
BENCHMARK(QelNormalFarTail);
BENCHMARK(BoostNormalFarTail);
BENCHMARK(QelInvNormalBody);
BENCHMARK(BoostInvNormalBody);
BENCHMARK(QelInvNormalFarTail);
BENCHMARK(BoostInvNormalFarTail);
BENCHMARK(QelTCentral);
BENCHMARK(BoostTCentral);
BENCHMARK(QelTNoncentralBody);
BENCHMARK(BoostTNoncentralBody);
BENCHMARK(QelTNoncentralUpperFar);
BENCHMARK(BoostTNoncentralUpperFar);
BENCHMARK(QelTNoncentralLowerFar);
BENCHMARK(BoostTNoncentralLowerFar);
BENCHMARK(QelHypergeoBody);
BENCHMARK(BoostHypergeoBody);
BENCHMARK(QelHypergeoLarge);
BENCHMARK(BoostHypergeoLarge);
