// Weibull maximum-likelihood fit and Anderson-Darling statistic for samples
// of 1e3, 1e5 and 1e6 points, on one thread and on all threads. The peer of
// the test is the same defining sum evaluated with Boost.Math's Weibull cdf;
// Boost.Math has no maximum-likelihood fit.
#include <benchmark/benchmark.h>
#include <omp.h>
#include <qel/fits.h>

#include <boost/math/distributions/weibull.hpp>
#include <cmath>
#include <vector>

namespace {

// A sorted Weibull(1.7, 3) sample: quantiles at a jittered uniform grid.
std::vector<double> weibullSample(std::size_t n) {
  std::vector<double> x(n);
  for (std::size_t i = 0; i < n; ++i) {
    const double u = (i + 0.5 + 0.3 * std::sin(7.0 * i)) / n;
    x[i] = 3.0 * std::pow(-std::log1p(-u), 1.0 / 1.7);
  }
  return x;
}

int threadsFor(const benchmark::State& state) {
  return state.range(1) == 0 ? 1 : omp_get_num_procs();
}

void QelFitWeibull(benchmark::State& state) {
  const auto x = weibullSample(static_cast<std::size_t>(state.range(0)));
  const int before = omp_get_max_threads();
  omp_set_num_threads(threadsFor(state));
  double par[2];
  for (auto _ : state) {
    benchmark::DoNotOptimize(qel::v2::FitWeibull(x.data(), par, static_cast<unsigned>(x.size())));
    benchmark::DoNotOptimize(par);
  }
  omp_set_num_threads(before);
  state.SetItemsProcessed(state.iterations() * state.range(0));
}

void QelWeibullADTest(benchmark::State& state) {
  const auto x = weibullSample(static_cast<std::size_t>(state.range(0)));
  const int before = omp_get_max_threads();
  omp_set_num_threads(threadsFor(state));
  const double par[2] = {1.7, 3.0};
  double a2, p;
  for (auto _ : state) {
    qel::v0::RunLynWeibullADTest(x.data(), par, &a2, &p, static_cast<unsigned>(x.size()));
    benchmark::DoNotOptimize(a2);
  }
  omp_set_num_threads(before);
  state.SetItemsProcessed(state.iterations() * state.range(0));
}

void BoostWeibullADStatistic(benchmark::State& state) {
  const auto x = weibullSample(static_cast<std::size_t>(state.range(0)));
  const boost::math::weibull_distribution<double> d(1.7, 3.0);
  const std::size_t n = x.size();
  for (auto _ : state) {
    double sum = 0.0;
    for (std::size_t i = 1; i <= n; ++i)
      sum += (2.0 * i - 1.0) * (std::log(boost::math::cdf(d, x[i - 1])) +
                                std::log(boost::math::cdf(complement(d, x[n - i]))));
    benchmark::DoNotOptimize(-static_cast<double>(n) - sum / n);
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
}

// range(0): sample size; range(1): 0 for one thread, 1 for all.
void sizes(benchmark::internal::Benchmark* b) {
  for (long n : {1000L, 100000L, 1000000L})
    for (long all : {0L, 1L}) b->Args({n, all});
  b->Unit(benchmark::kMicrosecond)->UseRealTime();
}

BENCHMARK(QelFitWeibull)->Apply(sizes);
BENCHMARK(QelWeibullADTest)->Apply(sizes);
BENCHMARK(BoostWeibullADStatistic)
    ->Args({1000, 0})
    ->Args({100000, 0})
    ->Args({1000000, 0})
    ->Unit(benchmark::kMicrosecond);

}  // namespace
