// Closed-form families: libqel's array forms (one state switch per column)
// and scalar forms against Boost.Math evaluated element by element.
#include <benchmark/benchmark.h>
#include <qel/distributions.h>

#include <boost/math/distributions/cauchy.hpp>
#include <boost/math/distributions/logistic.hpp>
#include <boost/math/distributions/triangular.hpp>
#include <vector>

namespace {

constexpr std::size_t kColumn = 4096;

std::vector<double> column(double from, double to) {
  std::vector<double> x(kColumn);
  for (std::size_t i = 0; i < kColumn; ++i) x[i] = from + (to - from) * (i + 0.5) / kColumn;
  return x;
}

void QelLogisticCdfArray(benchmark::State& state) {
  const auto x = column(-30, 30);
  std::vector<double> out(kColumn);
  for (auto _ : state) {
    qel::LogisticCdf(out.data(), x.data(), kColumn, 0.0, 1.0, true);
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}

void QelLogisticCdfScalar(benchmark::State& state) {
  const auto x = column(-30, 30);
  std::vector<double> out(kColumn);
  for (auto _ : state) {
    for (std::size_t i = 0; i < kColumn; ++i) out[i] = qel::LogisticCdf(x[i], 0.0, 1.0, true);
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}

void BoostLogisticCdf(benchmark::State& state) {
  const auto x = column(-30, 30);
  std::vector<double> out(kColumn);
  boost::math::logistic_distribution<double> d(0.0, 1.0);
  for (auto _ : state) {
    for (std::size_t i = 0; i < kColumn; ++i) out[i] = cdf(complement(d, x[i]));
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}

void QelCauchyInvCdfArray(benchmark::State& state) {
  const auto p = column(1e-6, 1 - 1e-6);
  std::vector<double> out(kColumn);
  for (auto _ : state) {
    qel::CauchyInvCdf(out.data(), p.data(), kColumn, 0.0, 1.0);
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}

void BoostCauchyQuantile(benchmark::State& state) {
  const auto p = column(1e-6, 1 - 1e-6);
  std::vector<double> out(kColumn);
  boost::math::cauchy_distribution<double> d(0.0, 1.0);
  for (auto _ : state) {
    for (std::size_t i = 0; i < kColumn; ++i) out[i] = quantile(d, p[i]);
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}

void QelTriangularCdfArray(benchmark::State& state) {
  const auto x = column(0, 3);
  std::vector<double> out(kColumn);
  for (auto _ : state) {
    qel::TriangularCdf(out.data(), x.data(), kColumn, 0.0, 1.0, 3.0, false);
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}

void BoostTriangularCdf(benchmark::State& state) {
  const auto x = column(0, 3);
  std::vector<double> out(kColumn);
  boost::math::triangular_distribution<double> d(0.0, 1.0, 3.0);
  for (auto _ : state) {
    for (std::size_t i = 0; i < kColumn; ++i) out[i] = cdf(d, x[i]);
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}

}  // namespace

BENCHMARK(QelLogisticCdfArray);
BENCHMARK(QelLogisticCdfScalar);
BENCHMARK(BoostLogisticCdf);
BENCHMARK(QelCauchyInvCdfArray);
BENCHMARK(BoostCauchyQuantile);
BENCHMARK(QelTriangularCdfArray);
BENCHMARK(BoostTriangularCdf);
