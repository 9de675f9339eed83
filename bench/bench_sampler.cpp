// Random variates per second: the exported sampler filling a 4096-element
// column (frame, distribution object and one draw per element, as a host
// calls it), beside Boost.Random's distributions on boost::random::mt19937
// filling the same column. The alias draw is measured on a prebuilt table of
// 1e6 outcomes, beside boost::random::discrete_distribution on the same
// weights.
#include <benchmark/benchmark.h>
#include <qel/sampler.h>

#include <boost/random/binomial_distribution.hpp>
#include <boost/random/discrete_distribution.hpp>
#include <boost/random/gamma_distribution.hpp>
#include <boost/random/mersenne_twister.hpp>
#include <boost/random/normal_distribution.hpp>
#include <boost/random/poisson_distribution.hpp>
#include <boost/random/uniform_real_distribution.hpp>
#include <functional>
#include <vector>

#include "interfaces/math/rngs.h"
#include "interfaces/math/rngs_sampling.h"

namespace {

constexpr unsigned kColumn = 4096;

void qelColumn(benchmark::State& state, std::function<int(qel::ISampler&, double*)> draw) {
  int code = 0;
  qel::ISampler* sampler = qel::MakeISampler(&code, 12345.0, qel::kRngCombinedCongruential);
  std::vector<double> out(kColumn);
  for (auto _ : state) {
    benchmark::DoNotOptimize(draw(*sampler, out.data()));
    benchmark::ClobberMemory();
  }
  qel::DeleteISampler(&sampler);
  state.SetItemsProcessed(state.iterations() * kColumn);
}

template <class Distribution>
void boostColumn(benchmark::State& state, Distribution distribution) {
  boost::random::mt19937 engine(12345);
  std::vector<double> out(kColumn);
  for (auto _ : state) {
    for (double& x : out) x = distribution(engine);
    benchmark::DoNotOptimize(out.data());
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}

void QelUniform(benchmark::State& s) {
  qelColumn(s, [](qel::ISampler& q, double* o) { return q.Uniform(o, kColumn, 0.0, 1.0); });
}
void BoostUniform(benchmark::State& s) {
  boostColumn(s, boost::random::uniform_real_distribution<double>(0.0, 1.0));
}
void QelNormal(benchmark::State& s) {
  qelColumn(s, [](qel::ISampler& q, double* o) { return q.Normal(o, kColumn, 0.0, 1.0); });
}
void BoostNormal(benchmark::State& s) {
  boostColumn(s, boost::random::normal_distribution<double>(0.0, 1.0));
}
void QelGamma(benchmark::State& s) {
  const double shape = s.range(0) / 10.0;
  qelColumn(s, [shape](qel::ISampler& q, double* o) { return q.Gamma(o, kColumn, shape, 1, 0); });
}
void BoostGamma(benchmark::State& s) {
  boostColumn(s, boost::random::gamma_distribution<double>(s.range(0) / 10.0, 1.0));
}
void QelBinomial(benchmark::State& s) {
  qelColumn(s, [](qel::ISampler& q, double* o) { return q.Binomial(o, kColumn, 20, 0.3); });
}
void BoostBinomial(benchmark::State& s) {
  boostColumn(s, boost::random::binomial_distribution<int, double>(20, 0.3));
}
void QelPoisson(benchmark::State& s) {
  const double mean = static_cast<double>(s.range(0));
  qelColumn(s, [mean](qel::ISampler& q, double* o) { return q.Poisson(o, kColumn, mean); });
}
void BoostPoisson(benchmark::State& s) {
  boostColumn(s, boost::random::poisson_distribution<int, double>(static_cast<double>(s.range(0))));
}

std::vector<double> aliasWeights() {
  std::vector<double> w(1000000);
  for (std::size_t i = 0; i < w.size(); ++i) w[i] = 1.0 + static_cast<double>(i * 7919 % 1000);
  return w;
}

void QelAlias(benchmark::State& state) {
  const std::vector<double> weights = aliasWeights();
  qel::v1::SamplingWithReplace alias(weights.data(), static_cast<unsigned>(weights.size()));
  qel::CmUniformGenerator generator(12345.0);
  alias.SetBrng(&generator);
  std::vector<double> out(kColumn);
  for (auto _ : state) {
    for (double& x : out) x = alias.GetValue();
    benchmark::DoNotOptimize(out.data());
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}
void BoostAlias(benchmark::State& state) {
  const std::vector<double> weights = aliasWeights();
  boostColumn(state,
              boost::random::discrete_distribution<int, double>(weights.begin(), weights.end()));
}

BENCHMARK(QelUniform);
BENCHMARK(BoostUniform);
BENCHMARK(QelNormal);
BENCHMARK(BoostNormal);
BENCHMARK(QelGamma)->Arg(5)->Arg(50);
BENCHMARK(BoostGamma)->Arg(5)->Arg(50);
BENCHMARK(QelBinomial);
BENCHMARK(BoostBinomial);
BENCHMARK(QelPoisson)->Arg(3)->Arg(1000000);
BENCHMARK(BoostPoisson)->Arg(3)->Arg(1000000);
BENCHMARK(QelAlias);
BENCHMARK(BoostAlias);

}  // namespace
