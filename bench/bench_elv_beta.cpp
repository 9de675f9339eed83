// Beta, binomial and F routines of the ELV family against Boost.Math on the
// same arguments: both tails per call (libqel computes both at once, Boost
// is asked for cdf and its complement). Point sets near the centre and in
// the far tails, where series lengths and continued fractions differ most.
#include <benchmark/benchmark.h>
#include <qel/elv.h>

#include <boost/math/distributions/binomial.hpp>
#include <boost/math/distributions/non_central_beta.hpp>
#include <boost/math/distributions/non_central_f.hpp>
#include <boost/math/higher_functions/beta.hpp>
#include <vector>

namespace {

struct BetaPoint {
  double x, a, b;
};

// Centre: x within a few standard deviations of the mean.
std::vector<BetaPoint> centralBeta() {
  std::vector<BetaPoint> v;
  for (double a : {0.5, 2.0, 7.5, 40.0, 300.0, 5000.0}) {
    for (double b : {0.7, 3.0, 12.0, 150.0, 2000.0}) {
      const double m = a / (a + b), sd = std::sqrt(m * (1 - m) / (a + b + 1));
      for (double z : {-2.0, -0.5, 0.7, 2.5}) {
        const double x = m + z * sd;
        if (x > 0 && x < 1) v.push_back({x, a, b});
      }
    }
  }
  return v;
}

// Far tails: tail probabilities from 1e-30 down to 1e-280.
std::vector<BetaPoint> farBeta() {
  std::vector<BetaPoint> v;
  for (double a : {2.0, 40.0, 300.0, 5000.0, 1e6}) {
    for (double b : {3.0, 150.0, 2000.0, 1e5}) {
      const double m = a / (a + b);
      for (double f : {1e-3, 0.05, 0.3}) v.push_back({m * f, a, b});
      for (double f : {0.3, 0.05}) v.push_back({1 - (1 - m) * f, a, b});
    }
  }
  return v;
}

void runQelBeta(benchmark::State& state, const std::vector<BetaPoint>& pts) {
  double lower, upper, density, sum = 0;
  for (auto _ : state) {
    for (const auto& p : pts) {
      beta_df(p.x, p.a, p.b, &lower, &upper, &density);
      sum += lower + upper;
    }
  }
  benchmark::DoNotOptimize(sum);
  state.SetItemsProcessed(state.iterations() * pts.size());
}

void runBoostBeta(benchmark::State& state, const std::vector<BetaPoint>& pts) {
  double sum = 0;
  for (auto _ : state) {
    for (const auto& p : pts) {
      sum += boost::math::ibeta(p.a, p.b, p.x) + boost::math::ibetac(p.a, p.b, p.x);
    }
  }
  benchmark::DoNotOptimize(sum);
  state.SetItemsProcessed(state.iterations() * pts.size());
}

void QelBetaDfCentre(benchmark::State& s) {
  runQelBeta(s, centralBeta());
}
void BoostIbetaCentre(benchmark::State& s) {
  runBoostBeta(s, centralBeta());
}
void QelBetaDfFarTails(benchmark::State& s) {
  runQelBeta(s, farBeta());
}
void BoostIbetaFarTails(benchmark::State& s) {
  runBoostBeta(s, farBeta());
}

struct NoncentralPoint {
  double x, a, b, L;
};

std::vector<NoncentralPoint> noncentralBeta(bool far) {
  std::vector<NoncentralPoint> v;
  for (double a : {1.5, 10.0, 100.0}) {
    for (double b : {2.0, 30.0, 500.0}) {
      for (double L : {1.0, 20.0, 400.0}) {
        const double m = (a + L) / (a + b + L);
        for (double f : far ? std::vector<double>{0.05, 0.2} : std::vector<double>{0.8, 1.0}) {
          v.push_back({m * f, a, b, L});
        }
      }
    }
  }
  return v;
}

void runQelNoncentralBeta(benchmark::State& state, bool far) {
  const auto pts = noncentralBeta(far);
  double lower, upper, sum = 0;
  for (auto _ : state) {
    for (const auto& p : pts) {
      beta_ncdf(p.x, p.a, p.b, p.L, &lower, &upper);
      sum += lower + upper;
    }
  }
  benchmark::DoNotOptimize(sum);
  state.SetItemsProcessed(state.iterations() * pts.size());
}

void runBoostNoncentralBeta(benchmark::State& state, bool far) {
  const auto pts = noncentralBeta(far);
  double sum = 0;
  for (auto _ : state) {
    for (const auto& p : pts) {
      boost::math::non_central_beta_distribution<double> d(p.a, p.b, p.L);
      sum += cdf(d, p.x) + cdf(complement(d, p.x));
    }
  }
  benchmark::DoNotOptimize(sum);
  state.SetItemsProcessed(state.iterations() * pts.size());
}

void QelBetaNcdfCentre(benchmark::State& s) {
  runQelNoncentralBeta(s, false);
}
void BoostNoncentralBetaCentre(benchmark::State& s) {
  runBoostNoncentralBeta(s, false);
}
void QelBetaNcdfFarTails(benchmark::State& s) {
  runQelNoncentralBeta(s, true);
}
void BoostNoncentralBetaFarTails(benchmark::State& s) {
  runBoostNoncentralBeta(s, true);
}

struct BinomialPoint {
  long k, n;
  double prob;
};

std::vector<BinomialPoint> binomialPoints(bool far) {
  std::vector<BinomialPoint> v;
  for (long n : {20L, 1000L, 100000L, 10000000L}) {
    for (double prob : {0.01, 0.3, 0.8}) {
      const double m = n * prob, sd = std::sqrt(m * (1 - prob));
      for (double z :
           far ? std::vector<double>{-12.0, 15.0} : std::vector<double>{-1.5, 0.0, 2.0}) {
        double k = std::floor(m + z * sd);
        if (k < 0 || k >= n) continue;
        v.push_back({static_cast<long>(k), n, prob});
      }
    }
  }
  return v;
}

void runQelBinomial(benchmark::State& state, bool far) {
  const auto pts = binomialPoints(far);
  double lower, upper, mass, sum = 0;
  for (auto _ : state) {
    for (const auto& p : pts) {
      binomial_df(p.k, p.n, p.prob, &lower, &upper, &mass);
      sum += lower + upper;
    }
  }
  benchmark::DoNotOptimize(sum);
  state.SetItemsProcessed(state.iterations() * pts.size());
}

void runBoostBinomial(benchmark::State& state, bool far) {
  const auto pts = binomialPoints(far);
  double sum = 0;
  for (auto _ : state) {
    for (const auto& p : pts) {
      boost::math::binomial_distribution<double> d(static_cast<double>(p.n), p.prob);
      sum += cdf(d, static_cast<double>(p.k)) + cdf(complement(d, static_cast<double>(p.k)));
    }
  }
  benchmark::DoNotOptimize(sum);
  state.SetItemsProcessed(state.iterations() * pts.size());
}

void QelBinomialDfCentre(benchmark::State& s) {
  runQelBinomial(s, false);
}
void BoostBinomialCentre(benchmark::State& s) {
  runBoostBinomial(s, false);
}
void QelBinomialDfFarTails(benchmark::State& s) {
  runQelBinomial(s, true);
}
void BoostBinomialFarTails(benchmark::State& s) {
  runBoostBinomial(s, true);
}

struct FPoint {
  double x, df1, df2, L;
};

std::vector<FPoint> fPoints(bool far) {
  std::vector<FPoint> v;
  for (double df1 : {2.0, 7.0, 40.0}) {
    for (double df2 : {5.0, 30.0, 400.0}) {
      for (double L : {0.0, 3.0, 60.0}) {
        const double centre = (df1 + L) / df1;
        for (double f :
             far ? std::vector<double>{0.01, 12.0} : std::vector<double>{0.6, 1.0, 1.7}) {
          v.push_back({centre * f, df1, df2, L});
        }
      }
    }
  }
  return v;
}

void runQelF(benchmark::State& state, bool far) {
  const auto pts = fPoints(far);
  double lower, upper, sum = 0;
  for (auto _ : state) {
    for (const auto& p : pts) {
      F_ncdf(p.x, p.df1, p.df2, p.L, &lower, &upper);
      sum += lower + upper;
    }
  }
  benchmark::DoNotOptimize(sum);
  state.SetItemsProcessed(state.iterations() * pts.size());
}

void runBoostF(benchmark::State& state, bool far) {
  const auto pts = fPoints(far);
  double sum = 0;
  for (auto _ : state) {
    for (const auto& p : pts) {
      boost::math::non_central_f_distribution<double> d(p.df1, p.df2, p.L);
      sum += cdf(d, p.x) + cdf(complement(d, p.x));
    }
  }
  benchmark::DoNotOptimize(sum);
  state.SetItemsProcessed(state.iterations() * pts.size());
}

void QelFNcdfCentre(benchmark::State& s) {
  runQelF(s, false);
}
void BoostNoncentralFCentre(benchmark::State& s) {
  runBoostF(s, false);
}
void QelFNcdfFarTails(benchmark::State& s) {
  runQelF(s, true);
}
void BoostNoncentralFFarTails(benchmark::State& s) {
  runBoostF(s, true);
}

}  // namespace

BENCHMARK(QelBetaDfCentre);
BENCHMARK(BoostIbetaCentre);
BENCHMARK(QelBetaDfFarTails);
BENCHMARK(BoostIbetaFarTails);
BENCHMARK(QelBetaNcdfCentre);
BENCHMARK(BoostNoncentralBetaCentre);
BENCHMARK(QelBetaNcdfFarTails);
BENCHMARK(BoostNoncentralBetaFarTails);
BENCHMARK(QelBinomialDfCentre);
BENCHMARK(BoostBinomialCentre);
BENCHMARK(QelBinomialDfFarTails);
BENCHMARK(BoostBinomialFarTails);
BENCHMARK(QelFNcdfCentre);
BENCHMARK(BoostNoncentralFCentre);
BENCHMARK(QelFNcdfFarTails);
BENCHMARK(BoostNoncentralFFarTails);
