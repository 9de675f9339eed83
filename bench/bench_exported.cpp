// Exported distribution functions: scalar Cdf and InvCdf per call and the
// array Cdf per element, beside Boost.Math on the same arguments (double
// precision policy). The scalar form pays one floating-point state switch
// per call, the array form one per column.
#include <benchmark/benchmark.h>
#include <qel/distributions.h>

#include <boost/math/distributions.hpp>
#include <vector>

namespace {

using DoublePolicy = boost::math::policies::policy<boost::math::policies::promote_double<false>>;

constexpr std::size_t kColumn = 1000000;
constexpr std::size_t kPoints = 1024;

std::vector<double> grid(double from, double to, std::size_t n) {
  std::vector<double> x(n);
  for (std::size_t i = 0; i < n; ++i) x[i] = from + (to - from) * (i + 0.5) / n;
  return x;
}

template <class F>
void perCall(benchmark::State& state, const std::vector<double>& x, F f) {
  for (auto _ : state) {
    for (double v : x) benchmark::DoNotOptimize(f(v));
  }
  state.SetItemsProcessed(state.iterations() * x.size());
}

template <class F>
void perElement(benchmark::State& state, double from, double to, F f) {
  const auto x = grid(from, to, kColumn);
  std::vector<double> out(kColumn);
  for (auto _ : state) {
    f(out.data(), x.data(), kColumn);
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}

// One family: libqel scalar Cdf, scalar InvCdf, array Cdf; Boost cdf and
// quantile on the same points.
#define QEL_BENCH_FAMILY(Name, from, to, QelCdf, QelInv, QelArray, boostDist)               \
  void Qel##Name##Cdf(benchmark::State& s) {                                                \
    perCall(s, grid(from, to, kPoints), [](double x) { return QelCdf; });                   \
  }                                                                                         \
  void Qel##Name##InvCdf(benchmark::State& s) {                                             \
    perCall(s, grid(1e-6, 1 - 1e-6, kPoints), [](double p) { return QelInv; });             \
  }                                                                                         \
  void Qel##Name##CdfArray(benchmark::State& s) {                                           \
    perElement(s, from, to, [](double* o, const double* x, unsigned long n) { QelArray; }); \
  }                                                                                         \
  void Boost##Name##Cdf(benchmark::State& s) {                                              \
    const auto d = boostDist;                                                               \
    perCall(s, grid(from, to, kPoints), [&](double x) { return cdf(complement(d, x)); });   \
  }                                                                                         \
  void Boost##Name##Quantile(benchmark::State& s) {                                         \
    const auto d = boostDist;                                                               \
    perCall(s, grid(1e-6, 1 - 1e-6, kPoints), [&](double p) { return quantile(d, p); });    \
  }                                                                                         \
  BENCHMARK(Qel##Name##Cdf);                                                                \
  BENCHMARK(Boost##Name##Cdf);                                                              \
  BENCHMARK(Qel##Name##InvCdf);                                                             \
  BENCHMARK(Boost##Name##Quantile);                                                         \
  BENCHMARK(Qel##Name##CdfArray)->Iterations(3);

QEL_BENCH_FAMILY(Normal, -8, 8, qel::NormalCdf(x, 0, 1, true), qel::NormalInvCdf(p, 0, 1),
                 qel::NormalCdf(o, x, n, 0, 1, true),
                 (boost::math::normal_distribution<double, DoublePolicy>(0, 1)))
QEL_BENCH_FAMILY(Gamma, 0.01, 30, qel::GammaCdf(x, 3.5, 1, 0, true), qel::GammaInvCdf(p, 3.5, 1, 0),
                 qel::GammaCdf(o, x, n, 3.5, 1, 0, true),
                 (boost::math::gamma_distribution<double, DoublePolicy>(3.5, 1)))
QEL_BENCH_FAMILY(ChiSq, 0.01, 40, qel::ChiSqCdf(x, 7, 0, true), qel::ChiSqInvCdf(p, 7, 0),
                 qel::ChiSqCdf(o, x, n, 7, 0, true),
                 (boost::math::chi_squared_distribution<double, DoublePolicy>(7)))
QEL_BENCH_FAMILY(Beta, 0.001, 0.999, qel::BetaCdf(x, 2.5, 7, true), qel::BetaInvCdf(p, 2.5, 7),
                 qel::BetaCdf(o, x, n, 2.5, 7, true),
                 (boost::math::beta_distribution<double, DoublePolicy>(2.5, 7)))
QEL_BENCH_FAMILY(F, 0.01, 20, qel::FCdf(x, 4, 12, 0, true), qel::FInvCdf(p, 4, 12, 0),
                 qel::FCdf(o, x, n, 4, 12, 0, true),
                 (boost::math::fisher_f_distribution<double, DoublePolicy>(4, 12)))
QEL_BENCH_FAMILY(T, -20, 20, qel::TCdf(x, 9, 0, true), qel::TInvCdf(p, 9, 0),
                 qel::TCdf(o, x, n, 9, 0, true),
                 (boost::math::students_t_distribution<double, DoublePolicy>(9)))
QEL_BENCH_FAMILY(NoncentralT, -10, 25, qel::TCdf(x, 9, 2.5, true), qel::TInvCdf(p, 9, 2.5),
                 qel::TCdf(o, x, n, 9, 2.5, true),
                 (boost::math::non_central_t_distribution<double, DoublePolicy>(9, 2.5)))
QEL_BENCH_FAMILY(Poisson, 0, 40, qel::PoissonCdf(x, 12, true), qel::PoissonInvCdf(p, 12),
                 qel::PoissonCdf(o, x, n, 12, true),
                 (boost::math::poisson_distribution<double, DoublePolicy>(12)))
QEL_BENCH_FAMILY(Weibull, 0.01, 10, qel::WeibullCdf(x, 1.7, 2, 0, true),
                 qel::WeibullInvCdf(p, 1.7, 2, 0), qel::WeibullCdf(o, x, n, 1.7, 2, 0, true),
                 (boost::math::weibull_distribution<double, DoublePolicy>(1.7, 2)))
QEL_BENCH_FAMILY(Logistic, -30, 30, qel::LogisticCdf(x, 0, 1, true), qel::LogisticInvCdf(p, 0, 1),
                 qel::LogisticCdf(o, x, n, 0, 1, true),
                 (boost::math::logistic_distribution<double, DoublePolicy>(0, 1)))

// Quantiles at a small shape, where the lower tail rises like x^0.05 and
// most quantiles of the grid lie below 1e-3 (the power-series region).
void QelGammaSmallShapeInvCdf(benchmark::State& s) {
  perCall(s, grid(1e-6, 1 - 1e-6, kPoints),
          [](double p) { return qel::GammaInvCdf(p, 0.05, 1, 0); });
}
void BoostGammaSmallShapeQuantile(benchmark::State& s) {
  const boost::math::gamma_distribution<double, DoublePolicy> d(0.05, 1);
  perCall(s, grid(1e-6, 1 - 1e-6, kPoints), [&](double p) { return quantile(d, p); });
}
void QelBetaSmallShapeInvCdf(benchmark::State& s) {
  perCall(s, grid(1e-6, 1 - 1e-6, kPoints), [](double p) { return qel::BetaInvCdf(p, 0.05, 4); });
}
void BoostBetaSmallShapeQuantile(benchmark::State& s) {
  const boost::math::beta_distribution<double, DoublePolicy> d(0.05, 4);
  perCall(s, grid(1e-6, 1 - 1e-6, kPoints), [&](double p) { return quantile(d, p); });
}
BENCHMARK(QelGammaSmallShapeInvCdf);
BENCHMARK(BoostGammaSmallShapeQuantile);
BENCHMARK(QelBetaSmallShapeInvCdf);
BENCHMARK(BoostBetaSmallShapeQuantile);

}  // namespace
