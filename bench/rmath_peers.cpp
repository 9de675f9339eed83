// Speed of the exported distribution functions beside Rmath (the standalone
// R mathematics library) and Boost.Math, same points, same run: scalar calls
// (one floating-point state switch each) and array forms per element.
#include <Rmath.h>
#include <benchmark/benchmark.h>
#include <qel/distributions.h>

#include <boost/math/distributions.hpp>
#include <vector>

namespace {

namespace bm = boost::math;
constexpr std::size_t kPoints = 1024;
constexpr std::size_t kColumn = 100000;

std::vector<double> grid(double from, double to, std::size_t n) {
  std::vector<double> x(n);
  for (std::size_t i = 0; i < n; ++i) x[i] = from + (to - from) * (i + 0.5) / n;
  return x;
}

template <class F>
void perCall(benchmark::State& state, double from, double to, F f) {
  const auto x = grid(from, to, kPoints);
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

// One row of the table: libqel, Rmath and Boost on the same points.
#define QEL_PEER_ROW(Name, from, to, qel, rmath, boost)   \
  void Qel_##Name(benchmark::State& s) {                  \
    perCall(s, from, to, [](double x) { return qel; });   \
  }                                                       \
  void Rmath_##Name(benchmark::State& s) {                \
    perCall(s, from, to, [](double x) { return rmath; }); \
  }                                                       \
  void Boost_##Name(benchmark::State& s) {                \
    perCall(s, from, to, [](double x) { return boost; }); \
  }                                                       \
  BENCHMARK(Qel_##Name);                                  \
  BENCHMARK(Rmath_##Name);                                \
  BENCHMARK(Boost_##Name);

const bm::normal_distribution<double> kNormal;
const bm::non_central_t_distribution<double> kNct(10.0, 2.0);
const bm::gamma_distribution<double> kGamma(4.5, 1.0);
const bm::beta_distribution<double> kBeta(2.5, 7.0);
const bm::binomial_distribution<double> kBinomial(200.0, 0.3);
const bm::fisher_f_distribution<double> kF(5.0, 12.0);
const bm::students_t_distribution<double> kT(10.0);
const bm::poisson_distribution<double> kPoisson(40.0);
const bm::hypergeometric_distribution<double> kHyper(150, 400, 1000);

QEL_PEER_ROW(NormalCdf, -8.0, 8.0, qel::NormalCdf(x, 0.0, 1.0, false), pnorm(x, 0.0, 1.0, 1, 0),
             bm::cdf(kNormal, x))
QEL_PEER_ROW(NormalInvCdf, 1e-6, 1.0 - 1e-6, qel::NormalInvCdf(x, 0.0, 1.0),
             qnorm(x, 0.0, 1.0, 1, 0), bm::quantile(kNormal, x))
QEL_PEER_ROW(NoncentralTCdf, -2.0, 8.0, qel::TCdf(x, 10.0, 2.0, false), pnt(x, 10.0, 2.0, 1, 0),
             bm::cdf(kNct, x))
QEL_PEER_ROW(NoncentralTInvCdf, 0.01, 0.99, qel::TInvCdf(x, 10.0, 2.0), qnt(x, 10.0, 2.0, 1, 0),
             bm::quantile(kNct, x))
QEL_PEER_ROW(GammaCdf, 0.1, 15.0, qel::GammaCdf(x, 4.5, 1.0, 0.0, false), pgamma(x, 4.5, 1.0, 1, 0),
             bm::cdf(kGamma, x))
QEL_PEER_ROW(BetaCdf, 0.001, 0.999, qel::BetaCdf(x, 2.5, 7.0, false), pbeta(x, 2.5, 7.0, 1, 0),
             bm::cdf(kBeta, x))
QEL_PEER_ROW(FCdf, 0.05, 6.0, qel::FCdf(x, 5.0, 12.0, 0.0, false), pf(x, 5.0, 12.0, 1, 0),
             bm::cdf(kF, x))
QEL_PEER_ROW(CentralTCdf, -5.0, 5.0, qel::TCdf(x, 10.0, 0.0, false), pt(x, 10.0, 1, 0),
             bm::cdf(kT, x))
QEL_PEER_ROW(BinomialCdf, 30.0, 90.0, qel::BinomialCdf(static_cast<int>(x), 200.0, 0.3, false),
             pbinom(static_cast<int>(x), 200.0, 0.3, 1, 0),
             bm::cdf(kBinomial, static_cast<double>(static_cast<int>(x))))
QEL_PEER_ROW(PoissonCdf, 10.0, 80.0, qel::PoissonCdf(static_cast<int>(x), 40.0, false),
             ppois(static_cast<int>(x), 40.0, 1, 0),
             bm::cdf(kPoisson, static_cast<double>(static_cast<int>(x))))
QEL_PEER_ROW(HypergeometricCdf, 40.0, 80.0,
             qel::HypergeometricCdf(static_cast<int>(x), 1000, 400, 150, false),
             phyper(static_cast<int>(x), 400.0, 600.0, 150.0, 1, 0),
             bm::cdf(kHyper, static_cast<unsigned>(x)))

// The same points through the array forms: one floating-point state switch
// per 1024 points, so the time per element is the kernel's own.
// Whole counts for the discrete laws, as the scalar rows take them.
template <class F>
void perArray(benchmark::State& state, double from, double to, bool whole, F f) {
  auto x = grid(from, to, kPoints);
  if (whole) {
    for (double& v : x) v = static_cast<int>(v);
  }
  std::vector<double> out(kPoints);
  for (auto _ : state) {
    f(out.data(), x.data(), static_cast<unsigned long>(kPoints));
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * kPoints);
}

#define QEL_ARRAY_ROW(Name, from, to, whole, call)                                           \
  void QelArray_##Name(benchmark::State& s) {                                                \
    perArray(s, from, to, whole, [](double* o, const double* x, unsigned long n) { call; }); \
  }                                                                                          \
  BENCHMARK(QelArray_##Name);

QEL_ARRAY_ROW(GammaCdf, 0.1, 15.0, false, qel::GammaCdf(o, x, n, 4.5, 1.0, 0.0, false))
QEL_ARRAY_ROW(BetaCdf, 0.001, 0.999, false, qel::BetaCdf(o, x, n, 2.5, 7.0, false))
QEL_ARRAY_ROW(BinomialCdf, 30.0, 90.0, true, qel::BinomialCdf(o, x, n, 200.0, 0.3, false))
QEL_ARRAY_ROW(PoissonCdf, 10.0, 80.0, true, qel::PoissonCdf(o, x, n, 40.0, false))
QEL_ARRAY_ROW(HypergeometricCdf, 40.0, 80.0, true,
              qel::HypergeometricCdf(o, x, n, 1000, 400, 150, false))

// Array forms, per element, against a loop of Rmath calls.
void Qel_NormalCdfArray(benchmark::State& s) {
  perElement(s, -8.0, 8.0, [](double* o, const double* x, unsigned long n) {
    qel::NormalCdf(o, x, n, 0.0, 1.0, false);
  });
}
void Rmath_NormalCdfArray(benchmark::State& s) {
  perElement(s, -8.0, 8.0, [](double* o, const double* x, unsigned long n) {
    for (unsigned long i = 0; i < n; ++i) o[i] = pnorm(x[i], 0.0, 1.0, 1, 0);
  });
}
void Qel_NormalInvCdfArray(benchmark::State& s) {
  perElement(s, 1e-6, 1.0 - 1e-6, [](double* o, const double* x, unsigned long n) {
    qel::NormalInvCdf(o, x, n, 0.0, 1.0);
  });
}
void Rmath_NormalInvCdfArray(benchmark::State& s) {
  perElement(s, 1e-6, 1.0 - 1e-6, [](double* o, const double* x, unsigned long n) {
    for (unsigned long i = 0; i < n; ++i) o[i] = qnorm(x[i], 0.0, 1.0, 1, 0);
  });
}
BENCHMARK(Qel_NormalCdfArray);
BENCHMARK(Rmath_NormalCdfArray);
BENCHMARK(Qel_NormalInvCdfArray);
BENCHMARK(Rmath_NormalInvCdfArray);

}  // namespace
