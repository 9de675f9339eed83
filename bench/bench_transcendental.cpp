// Incomplete beta ratio (BRATIO, ACM TOMS 708) and incomplete gamma ratio
// (mIncompleteGamma, ACM TOMS 654) against Boost.Math ibeta and gamma_p on
// the same points, in the default floating-point state.
#include <benchmark/benchmark.h>

#include <boost/math/higher_functions/beta.hpp>
#include <boost/math/higher_functions/gamma.hpp>
#include <cmath>
#include <vector>

#include "utilities/higher_functions/incomplete_beta.h"
#include "utilities/higher_functions/transcendental.h"

namespace {

// Boost promotes double to long double by default; this policy keeps it in
// double, as libqel works.
using NoPromotion = boost::math::policies::policy<boost::math::policies::promote_double<false>>;

struct BetaPoint {
  double a, b, x, y;
};
struct GammaPoint {
  double a, x;
};

double logScale(double lo, double hi, int i, int n) {
  return lo * std::pow(hi / lo, (i + 0.5) / n);
}

// Shapes 0.1 to 1000 on a log grid, x across (0, 1): all branches of the
// driver appear, weighted as an even grid weights them.
std::vector<BetaPoint> betaPoints() {
  std::vector<BetaPoint> points;
  for (int i = 0; i < 16; ++i) {
    for (int j = 0; j < 16; ++j) {
      for (int k = 0; k < 16; ++k) {
        const double x = (k + 0.5) / 16.0;
        points.push_back({logScale(0.1, 1000.0, i, 16), logScale(0.1, 1000.0, j, 16), x, 1.0 - x});
      }
    }
  }
  return points;
}

// Shape 0.1 to 1000, x from a/10 to 3a: the series, fraction, asymptotic and
// Temme regions.
std::vector<GammaPoint> gammaPoints() {
  std::vector<GammaPoint> points;
  for (int i = 0; i < 64; ++i) {
    const double a = logScale(0.1, 1000.0, i, 64);
    for (int k = 0; k < 64; ++k) points.push_back({a, a * logScale(0.1, 3.0, k, 64)});
  }
  return points;
}

void QelBratio(benchmark::State& state) {
  const auto points = betaPoints();
  for (auto _ : state) {
    for (const auto& p : points) {
      double w, w1;
      int ierr;
      qel::BRATIO(p.a, p.b, p.x, p.y, &w, &w1, &ierr);
      benchmark::DoNotOptimize(w);
      benchmark::DoNotOptimize(w1);
    }
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

void BoostIbeta(benchmark::State& state) {
  const auto points = betaPoints();
  for (auto _ : state) {
    for (const auto& p : points) benchmark::DoNotOptimize(boost::math::ibeta(p.a, p.b, p.x));
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

// Both tails from Boost, as BRATIO gives both.
void BoostIbetaBothTails(benchmark::State& state) {
  const auto points = betaPoints();
  for (auto _ : state) {
    for (const auto& p : points) {
      benchmark::DoNotOptimize(boost::math::ibeta(p.a, p.b, p.x));
      benchmark::DoNotOptimize(boost::math::ibetac(p.a, p.b, p.x));
    }
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

void BoostIbetaDouble(benchmark::State& state) {
  const auto points = betaPoints();
  for (auto _ : state) {
    for (const auto& p : points) {
      benchmark::DoNotOptimize(boost::math::ibeta(p.a, p.b, p.x, NoPromotion()));
    }
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

void BoostGammaPDouble(benchmark::State& state) {
  const auto points = gammaPoints();
  for (auto _ : state) {
    for (const auto& p : points) {
      benchmark::DoNotOptimize(boost::math::gamma_p(p.a, p.x, NoPromotion()));
    }
  }
  state.SetItemsProcessed(state.iterations() * points.size());
}

void QelIncompleteGamma(benchmark::State& state) {
  const auto points = gammaPoints();
  for (auto _ : state) {
    for (const auto& p : points) benchmark::DoNotOptimize(qel::mIncompleteGamma(p.x, p.a));
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

}  // namespace

BENCHMARK(QelBratio);
BENCHMARK(BoostIbeta);
BENCHMARK(BoostIbetaBothTails);
BENCHMARK(BoostIbetaDouble);
BENCHMARK(QelIncompleteGamma);
BENCHMARK(BoostGammaP);
BENCHMARK(BoostGammaPDouble);
