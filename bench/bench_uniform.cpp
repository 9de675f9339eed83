// The uniform generator: cost of one draw, filling a 4096-element column,
// beside the standard library's and Boost.Random's Mersenne twisters and
// Boost's combined multiplicative congruential generator (L'Ecuyer 1988), each
// with its own conversion to a double in [0, 1).
#include <benchmark/benchmark.h>

#include <boost/random/additive_combine.hpp>
#include <boost/random/mersenne_twister.hpp>
#include <boost/random/uniform_01.hpp>
#include <boost/random/uniform_real_distribution.hpp>
#include <random>
#include <vector>

#include "interfaces/math/rngs.h"

namespace {

constexpr std::size_t kColumn = 4096;

template <class Draw>
void fillColumn(benchmark::State& state, Draw draw) {
  std::vector<double> out(kColumn);
  for (auto _ : state) {
    for (double& x : out) x = draw();
    benchmark::DoNotOptimize(out.data());
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * kColumn);
}

void QelUniformGenerator(benchmark::State& state) {
  qel::CmUniformGenerator generator(12345.0);
  fillColumn(state, [&] { return generator.mGetRandom(); });
}

void StdMt19937_64(benchmark::State& state) {
  std::mt19937_64 engine(12345);
  std::uniform_real_distribution<double> uniform(0.0, 1.0);
  fillColumn(state, [&] { return uniform(engine); });
}

void BoostMt19937(benchmark::State& state) {
  boost::random::mt19937 engine(12345);
  boost::random::uniform_real_distribution<double> uniform(0.0, 1.0);
  fillColumn(state, [&] { return uniform(engine); });
}

void BoostEcuyer1988(benchmark::State& state) {
  boost::random::ecuyer1988 engine(12345);
  boost::random::uniform_01<double> uniform;
  fillColumn(state, [&] { return uniform(engine); });
}

BENCHMARK(QelUniformGenerator);
BENCHMARK(StdMt19937_64);
BENCHMARK(BoostMt19937);
BENCHMARK(BoostEcuyer1988);

}  // namespace
