// The gamma and noncentral chi-square ELV routines against Boost.Math on the
// same spread of arguments: shapes from 1/2 to 10^4, points from the far
// lower to the far upper tail. gamma_df returns both tails and the density
// in one call; Boost is timed for gamma_p alone and for gamma_p plus gamma_q.
// Times are per call (one argument set), reported as items per second.
#include <benchmark/benchmark.h>
#include <qel/elv.h>

#include <boost/math/distributions/non_central_chi_squared.hpp>
#include <boost/math/higher_functions/gamma.hpp>
#include <cmath>
#include <vector>

namespace {

struct GammaPoint {
  double x, a;
};

struct ChiPoint {
  double x, df, L;
};

std::vector<GammaPoint> gammaPoints() {
  std::vector<GammaPoint> points;
  for (double a : {0.5, 2.0, 10.0, 100.0, 1e4}) {
    for (double z = -6.0; z <= 8.0; z += 0.5) {
      const double x = a + z * std::sqrt(a);
      if (x > 0) points.push_back({x, a});
    }
  }
  return points;
}

std::vector<ChiPoint> chiPoints() {
  std::vector<ChiPoint> points;
  for (double df : {1.0, 5.0, 20.0}) {
    for (double L : {1.0, 10.0, 100.0}) {
      const double sd = std::sqrt(2 * (df + 2 * L));
      for (double z = -3.0; z <= 6.0; z += 0.5) {
        const double x = df + L + z * sd;
        if (x > 0) points.push_back({x, df, L});
      }
    }
  }
  return points;
}

void QelGammaDf(benchmark::State& state) {
  const auto points = gammaPoints();
  double lower, upper, density;
  for (auto _ : state) {
    for (const auto& p : points) {
      gamma_df(p.x, p.a, &lower, &upper, &density);
      benchmark::DoNotOptimize(lower);
      benchmark::DoNotOptimize(upper);
    }
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

void BoostGammaP(benchmark::State& state) {
  const auto points = gammaPoints();
  for (auto _ : state) {
    for (const auto& p : points) benchmark::DoNotOptimize(boost::math::gamma_p(p.a, p.x));
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

void BoostGammaPandQ(benchmark::State& state) {
  const auto points = gammaPoints();
  for (auto _ : state) {
    for (const auto& p : points) {
      benchmark::DoNotOptimize(boost::math::gamma_p(p.a, p.x));
      benchmark::DoNotOptimize(boost::math::gamma_q(p.a, p.x));
    }
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

void QelChi2Ncdf(benchmark::State& state) {
  const auto points = chiPoints();
  double lower, upper;
  for (auto _ : state) {
    for (const auto& p : points) {
      chi2_ncdf(p.x, p.df, p.L, &lower, &upper);
      benchmark::DoNotOptimize(lower);
      benchmark::DoNotOptimize(upper);
    }
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

void BoostNoncentralChi2Cdf(benchmark::State& state) {
  const auto points = chiPoints();
  for (auto _ : state) {
    for (const auto& p : points) {
      boost::math::non_central_chi_squared_distribution<double> d(p.df, p.L);
      benchmark::DoNotOptimize(cdf(d, p.x));
    }
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

void BoostNoncentralChi2BothTails(benchmark::State& state) {
  const auto points = chiPoints();
  for (auto _ : state) {
    for (const auto& p : points) {
      boost::math::non_central_chi_squared_distribution<double> d(p.df, p.L);
      benchmark::DoNotOptimize(cdf(d, p.x));
      benchmark::DoNotOptimize(cdf(complement(d, p.x)));
    }
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

}  // namespace

BENCHMARK(QelGammaDf);
BENCHMARK(BoostGammaP);
BENCHMARK(BoostGammaPandQ);
BENCHMARK(QelChi2Ncdf);
BENCHMARK(BoostNoncentralChi2Cdf);
BENCHMARK(BoostNoncentralChi2BothTails);
