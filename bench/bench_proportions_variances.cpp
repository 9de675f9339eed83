// Proportion and variance intervals, a whole call per iteration: the
// Clopper-Pearson interval with the exact test, the mid-P interval and the
// Wilson interval at n = 1e2, 1e4, 1e6 (x = 0.3 n); the two-variance test
// with Bonett's and with the Levene-type method at n1 = n2 = 1e6 on one
// thread and on all. The peer is R (bench/peer_proportions_variances.R,
// timed in the same session): binom.test, prop.test, var.test and the
// pooled t test on absolute deviations from the median.
#include <benchmark/benchmark.h>
#include <omp.h>
#include <qel/proportion_tests.h>
#include <qel/variance_tests.h>

#include <cstdint>
#include <random>
#include <vector>

namespace {

qel::v0::OneProportion counts(benchmark::State& state) {
  qel::v0::OneProportion r;
  r.trials = static_cast<unsigned int>(state.range(0));
  r.events = static_cast<unsigned int>(0.3 * state.range(0));
  return r;
}

void QelClopperPearsonWithTest(benchmark::State& state) {
  for (auto _ : state) {
    qel::v0::OneProportion r = counts(state);
    qel::v0::RunOneProportionClopperPearson(&r, 0.95, qel::kIntervalTwoSided);
    qel::v0::RunOneProportionClopperPearson(&r, qel::kAlternativeNotEqual, 0.31);
    benchmark::DoNotOptimize(r.pValue);
  }
}
BENCHMARK(QelClopperPearsonWithTest)
    ->Arg(100)
    ->Arg(10000)
    ->Arg(1000000)
    ->Unit(benchmark::kMicrosecond);

void QelMidPInterval(benchmark::State& state) {
  for (auto _ : state) {
    qel::v0::OneProportion r = counts(state);
    qel::v0::RunOneProportionMidP(&r, 0.95, qel::kIntervalTwoSided);
    benchmark::DoNotOptimize(r.upperLimit);
  }
}
BENCHMARK(QelMidPInterval)->Arg(100)->Arg(10000)->Arg(1000000)->Unit(benchmark::kMicrosecond);

void QelWilsonWithTest(benchmark::State& state) {
  for (auto _ : state) {
    qel::v0::OneProportion r = counts(state);
    qel::v0::RunOneProportionWilson(&r, false, 0.95, qel::kIntervalTwoSided);
    qel::v0::RunOneProportionWilson(&r, false, qel::kAlternativeNotEqual, 0.31);
    benchmark::DoNotOptimize(r.pValue);
  }
}
BENCHMARK(QelWilsonWithTest)->Arg(100)->Arg(10000)->Arg(1000000)->Unit(benchmark::kMicrosecond);

std::vector<double> normalSample(std::size_t n, std::uint64_t seed, double sigma) {
  std::mt19937_64 engine(seed);
  std::normal_distribution<double> normal(0.0, sigma);
  std::vector<double> v(n);
  for (double& e : v) e = normal(engine);
  return v;
}

// range(0): 1 Levene, 0 Bonett; range(1): threads (0: all).
void QelTwoVariances(benchmark::State& state) {
  const std::size_t n = 1000000;
  const auto x = normalSample(n, 1, 1.0);
  const auto y = normalSample(n, 2, 1.05);
  const int saved = omp_get_max_threads();
  omp_set_num_threads(state.range(1) > 0 ? static_cast<int>(state.range(1)) : omp_get_num_procs());
  for (auto _ : state) {
    qel::v0::TwoVariance r;
    r.firstN = r.secondN = static_cast<unsigned int>(n);
    qel::v0::RunTwoVariance(&r, x.data(), y.data(), 0.95, qel::kIntervalTwoSided,
                            qel::kAlternativeNotEqual, 1.0, state.range(0) != 0);
    benchmark::DoNotOptimize(r.fPValue);
  }
  omp_set_num_threads(saved);
}
BENCHMARK(QelTwoVariances)
    ->Args({0, 1})
    ->Args({0, 0})
    ->Args({1, 1})
    ->Args({1, 0})
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime();

}  // namespace
