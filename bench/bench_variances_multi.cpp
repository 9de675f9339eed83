// The multi-sample variances test, general form (Bonett limits, multiple
// comparisons, Levene's regression), on 10 samples of 1e6 values, one
// thread and all threads; the normal form (Bartlett) alongside. The peer is
// R's bartlett.test plus the Levene lm in bench/peer_variances_multi.R.
#include <benchmark/benchmark.h>
#include <omp.h>
#include <qel/variances_test.h>

#include <cstdint>
#include <vector>

namespace {

constexpr unsigned kSamples = 10;
constexpr std::size_t kSize = 1000000;

// Uniform values with spreads growing by 5% a sample.
const std::vector<std::vector<double>>& data() {
  static const auto xs = [] {
    std::vector<std::vector<double>> v(kSamples, std::vector<double>(kSize));
    std::uint32_t seed = 20261123u;
    for (unsigned i = 0; i < kSamples; ++i)
      for (double& x : v[i]) {
        seed = 1664525u * seed + 1013904223u;
        x = (1.0 + 0.05 * i) * (seed >> 8) * 0x1p-24;
      }
    return v;
  }();
  return xs;
}

void QelVariancesTest(benchmark::State& state, bool normal, int threads) {
  const auto& xs = data();
  std::vector<qel::v0::VariancesTestSample> s(kSamples);
  const int saved = omp_get_max_threads();
  omp_set_num_threads(threads > 0 ? threads : omp_get_num_procs());
  for (auto _ : state) {
    for (unsigned i = 0; i < kSamples; ++i) {
      s[i].data = xs[i].data();
      s[i].n = static_cast<unsigned>(kSize);
    }
    qel::v0::VariancesTest t;
    t.samples = s.data();
    t.k = kSamples;
    benchmark::DoNotOptimize(qel::v0::RunVariancesTest(&t, 0.95, normal));
    benchmark::DoNotOptimize(t.mainPValue);
  }
  omp_set_num_threads(saved);
}

BENCHMARK_CAPTURE(QelVariancesTest, general_1thread, false, 1)
    ->Unit(benchmark::kMillisecond)
    ->Iterations(3);
BENCHMARK_CAPTURE(QelVariancesTest, general_all, false, 0)
    ->Unit(benchmark::kMillisecond)
    ->Iterations(3);
BENCHMARK_CAPTURE(QelVariancesTest, normal_1thread, true, 1)
    ->Unit(benchmark::kMillisecond)
    ->Iterations(3);

}  // namespace
