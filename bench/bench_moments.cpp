// One-pass compensated moments and sums against the plain loops they
// replace, and against Boost.Accumulators, on 1e7 doubles (1e9 + noise).
// The counter time/elem is the time per element.
#include <benchmark/benchmark.h>
#include <qel/descriptive.h>

#include <boost/accumulators/accumulators.hpp>
#include <boost/accumulators/statistics/mean.hpp>
#include <boost/accumulators/statistics/stats.hpp>
#include <boost/accumulators/statistics/sum_kahan.hpp>
#include <boost/accumulators/statistics/variance.hpp>
#include <cstdint>
#include <vector>

namespace {

constexpr unsigned kElements = 10000000;

const std::vector<double>& data() {
  static const std::vector<double> x = [] {
    std::vector<double> v(kElements);
    std::uint32_t s = 12345;
    for (auto& e : v) {
      s = 1664525u * s + 1013904223u;
      e = 1e9 + (s >> 8) * 0x1p-24;
    }
    return v;
  }();
  return x;
}

void perElement(benchmark::State& state) {
  state.counters["time/elem"] = benchmark::Counter(
      kElements, benchmark::Counter::kIsIterationInvariantRate | benchmark::Counter::kInvert);
}

void QelMeanAndVariance(benchmark::State& state) {
  const auto& x = data();
  for (auto _ : state) {
    double mean, variance;
    qel::v1::GetSampleMeanAndVariance(x.data(), kElements, &mean, &variance);
    benchmark::DoNotOptimize(mean);
    benchmark::DoNotOptimize(variance);
  }
  perElement(state);
}

void PlainTwoPassMeanAndVariance(benchmark::State& state) {
  const auto& x = data();
  for (auto _ : state) {
    double sum = 0.0;
    for (double v : x) sum += v;
    const double mean = sum / kElements;
    double ss = 0.0;
    for (double v : x) ss += (v - mean) * (v - mean);
    const double variance = ss / (kElements - 1.0);
    benchmark::DoNotOptimize(mean);
    benchmark::DoNotOptimize(variance);
  }
  perElement(state);
}

void BoostAccumulatorsMeanAndVariance(benchmark::State& state) {
  namespace acc = boost::accumulators;
  const auto& x = data();
  for (auto _ : state) {
    acc::accumulator_set<double, acc::stats<acc::tag::variance>> a;
    for (double v : x) a(v);
    double mean = acc::mean(a);
    double variance = acc::variance(a);  // denominator n
    benchmark::DoNotOptimize(mean);
    benchmark::DoNotOptimize(variance);
  }
  perElement(state);
}

void QelSum(benchmark::State& state) {
  const auto& x = data();
  for (auto _ : state) benchmark::DoNotOptimize(qel::v1::GetSum(x.data(), kElements));
  perElement(state);
}

void PlainSum(benchmark::State& state) {
  const auto& x = data();
  for (auto _ : state) {
    double sum = 0.0;
    for (double v : x) sum += v;
    benchmark::DoNotOptimize(sum);
  }
  perElement(state);
}

void BoostAccumulatorsKahanSum(benchmark::State& state) {
  namespace acc = boost::accumulators;
  const auto& x = data();
  for (auto _ : state) {
    acc::accumulator_set<double, acc::stats<acc::tag::sum_kahan>> a;
    for (double v : x) a(v);
    benchmark::DoNotOptimize(acc::sum_kahan(a));
  }
  perElement(state);
}

}  // namespace

BENCHMARK(QelMeanAndVariance)->Unit(benchmark::kMillisecond);
BENCHMARK(PlainTwoPassMeanAndVariance)->Unit(benchmark::kMillisecond);
BENCHMARK(BoostAccumulatorsMeanAndVariance)->Unit(benchmark::kMillisecond);
BENCHMARK(QelSum)->Unit(benchmark::kMillisecond);
BENCHMARK(PlainSum)->Unit(benchmark::kMillisecond);
BENCHMARK(BoostAccumulatorsKahanSum)->Unit(benchmark::kMillisecond);
