// The location tests end to end (moments, quantile, P-value) against the
// same computation written with Boost.Math's students_t and normal on the
// same data: n = 30, where the quantile and tail dominate, and n = 1e6,
// where the pass over the data does.
#include <benchmark/benchmark.h>
#include <qel/location_tests.h>

#include <boost/math/distributions/normal.hpp>
#include <boost/math/distributions/students_t.hpp>
#include <cmath>
#include <cstdint>
#include <vector>

namespace {

std::vector<double> sample(unsigned n, std::uint32_t seed, double shift) {
  std::vector<double> v(n);
  for (auto& e : v) {
    seed = 1664525u * seed + 1013904223u;
    e = shift + (seed >> 8) * 0x1p-24;
  }
  return v;
}

void QelOneSampleT(benchmark::State& state) {
  const auto n = static_cast<unsigned>(state.range(0));
  const auto x = sample(n, 7, 10.0);
  for (auto _ : state) {
    qel::v0::OneSampleT r;
    r.n = n;
    qel::v0::RunOneSampleT(&r, x.data(), 0.95, qel::kIntervalTwoSided, qel::kAlternativeNotEqual,
                           10.5);
    benchmark::DoNotOptimize(r.pValue);
  }
}

// Two-pass moments, then the quantile and both tails from Boost.Math.
void BoostOneSampleT(benchmark::State& state) {
  const auto n = static_cast<unsigned>(state.range(0));
  const auto x = sample(n, 7, 10.0);
  for (auto _ : state) {
    double sum = 0.0;
    for (double v : x) sum += v;
    const double mean = sum / n;
    double ss = 0.0;
    for (double v : x) ss += (v - mean) * (v - mean);
    const double se = std::sqrt(ss / (n - 1.0)) / std::sqrt(double(n));
    const boost::math::students_t t(n - 1.0);
    const double q = boost::math::quantile(t, 0.975);
    const double stat = (mean - 10.5) / se;
    const double p = 2 * boost::math::cdf(boost::math::complement(t, std::fabs(stat)));
    benchmark::DoNotOptimize(mean - se * q);
    benchmark::DoNotOptimize(p);
  }
}

void QelWelchT(benchmark::State& state) {
  const auto n = static_cast<unsigned>(state.range(0));
  const auto x = sample(n, 7, 10.0);
  const auto y = sample(n, 11, 10.1);
  for (auto _ : state) {
    qel::v0::TwoSampleT r;
    r.firstN = r.secondN = n;
    qel::v0::RunTwoSampleT(&r, x.data(), y.data(), false, 0.95, qel::kIntervalTwoSided,
                           qel::kAlternativeNotEqual, 0.0);
    benchmark::DoNotOptimize(r.pValue);
  }
}

void QelOneSampleZSummary(benchmark::State& state) {
  for (auto _ : state) {
    qel::v0::OneSampleZ r;
    r.n = 30;
    r.mean = 10.2;
    qel::v0::RunOneSampleZ(&r, 1.0, 0.95, qel::kIntervalTwoSided, qel::kAlternativeNotEqual, 10.0);
    benchmark::DoNotOptimize(r.pValue);
  }
}

void BoostOneSampleZSummary(benchmark::State& state) {
  const boost::math::normal z;
  for (auto _ : state) {
    const double se = 1.0 / std::sqrt(30.0);
    const double q = boost::math::quantile(z, 0.975);
    const double stat = (10.2 - 10.0) / se;
    const double p = 2 * boost::math::cdf(boost::math::complement(z, std::fabs(stat)));
    benchmark::DoNotOptimize(10.2 - se * q);
    benchmark::DoNotOptimize(p);
  }
}

}  // namespace

BENCHMARK(QelOneSampleT)->Arg(30)->Arg(1000000);
BENCHMARK(BoostOneSampleT)->Arg(30)->Arg(1000000);
BENCHMARK(QelWelchT)->Arg(30)->Arg(1000000);
BENCHMARK(QelOneSampleZSummary);
BENCHMARK(BoostOneSampleZSummary);
