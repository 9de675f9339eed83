// RunLynTabularChiSqGOFTest on k = 1e3, 1e6 and 1e7 categories of Poisson-
// like counts against unequal proportions, and ComputeTicks over 1e5 random
// ranges with maxTicks 11 and 100. The peers (R's chisq.test and pretty,
// SciPy's chisquare where installed) run from bench/peer_gof_ticks.R and
// bench/peer_gof_ticks.py on data of the same shape.
#include <benchmark/benchmark.h>
#include <qel/axis_ticks.h>
#include <qel/tabular_gof.h>

#include <cfloat>
#include <cmath>
#include <cstdint>
#include <vector>

namespace {

struct Lcg {
  std::uint64_t state = 2929;
  double next() {
    state = state * 6364136223846793005ull + 1442695040888963407ull;
    return static_cast<double>(state >> 11) * 0x1.0p-53;
  }
};

void QelTabularChiSqGof(benchmark::State& state) {
  const auto k = static_cast<std::size_t>(state.range(0));
  Lcg g;
  std::vector<double> counts(k), p(k), expected(k), contributions(k);
  double weight = 0.0, total = 0.0;
  for (std::size_t i = 0; i < k; ++i) {
    p[i] = 0.5 + g.next();
    weight += p[i];
  }
  for (std::size_t i = 0; i < k; ++i) {
    p[i] /= weight;
    counts[i] = std::floor(p[i] * 1e3 * k * (0.9 + 0.2 * g.next()));
    total += counts[i];
  }
  double statistic = 0.0, pValue = 0.0, df = 0.0;
  for (auto _ : state) {
    qel::RunLynTabularChiSqGOFTest(counts.data(), p.data(), expected.data(), contributions.data(),
                                   &statistic, &pValue, &df, total, static_cast<unsigned>(k));
    benchmark::DoNotOptimize(pValue);
  }
  state.counters["statistic"] = statistic;
}
BENCHMARK(QelTabularChiSqGof)
    ->Arg(1000)
    ->Arg(1000000)
    ->Arg(10000000)
    ->Unit(benchmark::kMillisecond);

// Ranges of random magnitude (1e-10 to 1e10), sign and relative width.
std::vector<double> ranges(std::size_t n) {
  Lcg g;
  std::vector<double> r(2 * n);
  for (std::size_t i = 0; i < n; ++i) {
    const double mag = std::pow(10.0, -10 + 20 * g.next()) * (g.next() < 0.5 ? -1 : 1);
    r[2 * i] = mag * (0.05 + g.next());
    r[2 * i + 1] = r[2 * i] + std::fabs(mag) * std::pow(10.0, -3 + 3.5 * g.next());
  }
  return r;
}

// Time per call over 1e5 ranges; range(0): maxTicks.
void QelComputeTicks(benchmark::State& state) {
  const std::size_t n = 100000;
  const std::vector<double> r = ranges(n);
  const int maxTicks = static_cast<int>(state.range(0));
  qel::deprecated::TickCalculationResult result;
  for (auto _ : state) {
    for (std::size_t i = 0; i < n; ++i) {
      qel::deprecated::ComputeTicks(&result, 4, maxTicks, 0, 0.05, 0, 0.05, -DBL_MAX, DBL_MAX, 0.5,
                                    0.5, r[2 * i], r[2 * i + 1]);
      benchmark::DoNotOptimize(result);
    }
  }
  state.SetItemsProcessed(static_cast<int64_t>(state.iterations() * n));
}
BENCHMARK(QelComputeTicks)->Arg(11)->Arg(100)->Unit(benchmark::kMillisecond);

}  // namespace
