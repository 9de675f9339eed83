// The rank tests on large samples, a whole call per iteration: Mann-Whitney
// with the Hodges-Lehmann shift and its 95% interval (three selections among
// n1 * n2 differences that are never formed), Kruskal-Wallis on 1e7
// observations in 10 groups on one thread and on all, and the sign and
// Wilcoxon signed rank tests on 1e6. The peer is R (bench/peer_rank_tests.R,
// timed separately in the same session); Boost has no rank tests.
#include <benchmark/benchmark.h>
#include <omp.h>
#include <qel/rank_tests.h>
#include <qel/sign_tests.h>
#include <sys/resource.h>

#include <cstdint>
#include <random>
#include <vector>

namespace {

std::vector<double> normalSample(std::size_t n, std::uint64_t seed, double shift) {
  std::mt19937_64 engine(seed);
  std::normal_distribution<double> normal(shift, 1.0);
  std::vector<double> v(n);
  for (double& e : v) e = normal(engine);
  return v;
}

// Peak resident set of the process in MB: with the sizes run in ascending
// order, the peak of the largest size.
double peakResidentMegabytes() {
  rusage usage{};
  getrusage(RUSAGE_SELF, &usage);
  return usage.ru_maxrss / 1024.0;
}

void QelMannWhitneyInterval(benchmark::State& state) {
  const auto n = static_cast<std::size_t>(state.range(0));
  const auto x = normalSample(n, 1, 0.2);
  const auto y = normalSample(n, 2, 0.0);
  for (auto _ : state) {
    qel::v0::MannWhitney r;
    r.firstN = r.secondN = static_cast<int>(n);
    qel::v0::RunLynMannWhitney(&r, x.data(), y.data(), 0.95, qel::kIntervalTwoSided,
                               qel::kAlternativeNotEqual);
    benchmark::DoNotOptimize(r.lowerLimit);
    benchmark::DoNotOptimize(r.pValue);
  }
  state.counters["peak_MB"] = peakResidentMegabytes();
}
BENCHMARK(QelMannWhitneyInterval)
    ->Arg(10000)
    ->Arg(100000)
    ->Arg(1000000)
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime();

// 1e7 observations in ten groups of 1e6, shifted by a tenth from one group
// to the next; the argument is the thread count (0: all of them).
void QelKruskalWallis(benchmark::State& state) {
  const int saved = omp_get_max_threads();
  const int threads = state.range(0) > 0 ? static_cast<int>(state.range(0)) : omp_get_num_procs();
  std::vector<std::vector<double>> data(10);
  std::vector<qel::v0::KruskalWallisGroup> groups(10);
  for (int g = 0; g < 10; ++g) {
    data[g] = normalSample(1000000, 10 + g, 0.1 * g);
    groups[g].data = data[g].data();
    groups[g].n = 1000000;
  }
  omp_set_num_threads(threads);
  for (auto _ : state) {
    qel::v0::KruskalWallis r;
    r.groups = groups.data();
    r.groupCount = 10;
    qel::v0::RunLynKruskalWallis(&r);
    benchmark::DoNotOptimize(r.pValue);
  }
  omp_set_num_threads(saved);
  state.counters["threads"] = threads;
}
BENCHMARK(QelKruskalWallis)->Arg(1)->Arg(0)->Unit(benchmark::kMillisecond)->UseRealTime();

void QelSignTest(benchmark::State& state) {
  const auto n = static_cast<unsigned>(state.range(0));
  const auto x = normalSample(n, 3, 0.01);
  for (auto _ : state) {
    qel::v0::OneSampleSign r;
    r.n = n;
    qel::v0::RunLynOneSampleSign(&r, x.data(), 0.95, qel::kIntervalTwoSided,
                                 qel::kAlternativeNotEqual, 0.0);
    benchmark::DoNotOptimize(r.pValue);
  }
}
BENCHMARK(QelSignTest)->Arg(1000000)->Unit(benchmark::kMillisecond)->UseRealTime();

void QelWilcoxonSignedRank(benchmark::State& state) {
  const auto n = static_cast<int>(state.range(0));
  const auto x = normalSample(static_cast<std::size_t>(n), 4, 0.01);
  for (auto _ : state) {
    qel::v0::OneSampleWilcoxon r;
    r.n = n;
    qel::v0::RunLynOneSampleWilcoxon(&r, x.data(), 0.95, qel::kIntervalTwoSided,
                                     qel::kAlternativeNotEqual, 0.0);
    benchmark::DoNotOptimize(r.pValue);
  }
}
BENCHMARK(QelWilcoxonSignedRank)->Arg(1000000)->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace
