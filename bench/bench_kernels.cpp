// Distribution kernels against Boost.Math on the same arguments: the t
// quantile, the two-sided binomial P-value (no peer), the gamma
// quantile (ELV quantile plus check), the Poisson upper tail (chi-square
// relation), the standard normal quantile, the negative binomial quantile
// (Cornish-Fisher start and integer search) and the exponential lower tail
// near the threshold (chi-square route). Kernels run without the
// floating-point frame. Times are per call, reported as items per second.
#include <benchmark/benchmark.h>

#include <boost/math/distributions/exponential.hpp>
#include <boost/math/distributions/negative_binomial.hpp>
#include <boost/math/distributions/normal.hpp>
#include <boost/math/distributions/poisson.hpp>
#include <boost/math/distributions/students_t.hpp>
#include <boost/math/higher_functions/gamma.hpp>
#include <vector>

#include "utilities/distributions/kernels.h"

namespace {

// Double-only policy: no promotion to long double, no errno side effects.
using DoublePolicy = boost::math::policies::policy<
    boost::math::policies::promote_double<false>,
    boost::math::policies::discrete_quantile<boost::math::policies::integer_round_up>>;

std::vector<double> probabilities() {
  std::vector<double> ps;
  for (double p : {1e-10, 1e-6, 1e-3, 0.01, 0.1, 0.3, 0.5, 0.7, 0.9, 0.99, 0.999999}) {
    ps.push_back(p);
  }
  return ps;
}

const double kShapes[] = {0.5, 3.0, 40.0, 1000.0};

void QelGammaInvCdf(benchmark::State& state) {
  const auto ps = probabilities();
  for (auto _ : state) {
    for (double a : kShapes) {
      for (double p : ps) benchmark::DoNotOptimize(qel::mGammaInvCdf(p, a, 1.0, 0.0));
    }
  }
  state.SetItemsProcessed(state.iterations() * ps.size() * 4);
}

void BoostGammaPInv(benchmark::State& state) {
  const auto ps = probabilities();
  for (auto _ : state) {
    for (double a : kShapes) {
      for (double p : ps) {
        benchmark::DoNotOptimize(p <= 0.5 ? boost::math::gamma_p_inv(a, p, DoublePolicy())
                                          : boost::math::gamma_q_inv(a, 1.0 - p, DoublePolicy()));
      }
    }
  }
  state.SetItemsProcessed(state.iterations() * ps.size() * 4);
}

void QelPoissonUpper(benchmark::State& state) {
  for (auto _ : state) {
    for (double mean : {0.5, 7.0, 120.0, 5000.0}) {
      for (double z = -4.0; z <= 8.0; z += 1.0) {
        const double k = std::floor(mean + z * std::sqrt(mean)) + 1.0;
        benchmark::DoNotOptimize(qel::mPoissonCdf(k < 0 ? 0 : k, mean, true));
      }
    }
  }
  state.SetItemsProcessed(state.iterations() * 4 * 13);
}

void BoostPoissonUpper(benchmark::State& state) {
  for (auto _ : state) {
    for (double mean : {0.5, 7.0, 120.0, 5000.0}) {
      boost::math::poisson_distribution<double, DoublePolicy> d(mean);
      for (double z = -4.0; z <= 8.0; z += 1.0) {
        const double k = std::floor(mean + z * std::sqrt(mean)) + 1.0;
        // P(X >= k) = complement of P(X <= k - 1).
        benchmark::DoNotOptimize(k <= 0 ? 1.0 : cdf(complement(d, k - 1.0)));
      }
    }
  }
  state.SetItemsProcessed(state.iterations() * 4 * 13);
}

void QelNormalInvCdf(benchmark::State& state) {
  const auto ps = probabilities();
  for (auto _ : state) {
    for (double p : ps) benchmark::DoNotOptimize(qel::mNormalInvCdf(p, 0.0, 1.0));
  }
  state.SetItemsProcessed(state.iterations() * ps.size());
}

void BoostNormalQuantile(benchmark::State& state) {
  const auto ps = probabilities();
  boost::math::normal_distribution<double, DoublePolicy> d;
  for (auto _ : state) {
    for (double p : ps) benchmark::DoNotOptimize(quantile(d, p));
  }
  state.SetItemsProcessed(state.iterations() * ps.size());
}

void QelNegBinomialInvCdf(benchmark::State& state) {
  const auto ps = probabilities();
  for (auto _ : state) {
    for (double p : ps) benchmark::DoNotOptimize(qel::mNegBinomialInvCdf(p, 0.3, 5.0));
  }
  state.SetItemsProcessed(state.iterations() * ps.size());
}

// Boost counts failures before the r-th success; add r for the trial count.
void BoostNegBinomialQuantile(benchmark::State& state) {
  const auto ps = probabilities();
  boost::math::negative_binomial_distribution<double, DoublePolicy> d(5.0, 0.3);
  for (auto _ : state) {
    for (double p : ps) benchmark::DoNotOptimize(quantile(d, p) + 5.0);
  }
  state.SetItemsProcessed(state.iterations() * ps.size());
}

void QelExponentialLowerNearThreshold(benchmark::State& state) {
  for (auto _ : state) {
    for (double x = 1e-9; x < 1e-3; x *= 3.0) {
      benchmark::DoNotOptimize(qel::mExponentialCdf(x, 1.0, 0.0, false));
    }
  }
  state.SetItemsProcessed(state.iterations() * 13);
}

void BoostExponentialLowerNearThreshold(benchmark::State& state) {
  boost::math::exponential_distribution<double, DoublePolicy> d(1.0);
  for (auto _ : state) {
    for (double x = 1e-9; x < 1e-3; x *= 3.0) benchmark::DoNotOptimize(cdf(d, x));
  }
  state.SetItemsProcessed(state.iterations() * 13);
}

const double kDegrees[] = {1.5, 4.0, 30.0, 500.0};

void QelTInvCdf(benchmark::State& state) {
  const auto ps = probabilities();
  for (auto _ : state) {
    for (double df : kDegrees) {
      for (double p : ps) benchmark::DoNotOptimize(qel::mTInvCdf(p, df, 0.0));
    }
  }
  state.SetItemsProcessed(state.iterations() * ps.size() * 4);
}

void BoostTQuantile(benchmark::State& state) {
  const auto ps = probabilities();
  for (auto _ : state) {
    for (double df : kDegrees) {
      boost::math::students_t_distribution<double, DoublePolicy> d(df);
      for (double p : ps) benchmark::DoNotOptimize(quantile(d, p));
    }
  }
  state.SetItemsProcessed(state.iterations() * ps.size() * 4);
}

// Two-sided likelihood-ratio P-value over all outcomes of n = 60, p = 0.3;
// no peer routine exists.
void QelBinomialTwoSidedPValue(benchmark::State& state) {
  for (auto _ : state) {
    for (int k = 0; k <= 60; ++k) {
      benchmark::DoNotOptimize(qel::mBinomialPValue(k, 60, 0.3, qel::kAlternativeNotEqual));
    }
  }
  state.SetItemsProcessed(state.iterations() * 61);
}

}  // namespace

BENCHMARK(QelTInvCdf);
BENCHMARK(BoostTQuantile);
BENCHMARK(QelBinomialTwoSidedPValue);
BENCHMARK(QelGammaInvCdf);
BENCHMARK(BoostGammaPInv);
BENCHMARK(QelPoissonUpper);
BENCHMARK(BoostPoissonUpper);
BENCHMARK(QelNormalInvCdf);
BENCHMARK(BoostNormalQuantile);
BENCHMARK(QelNegBinomialInvCdf);
BENCHMARK(BoostNegBinomialQuantile);
BENCHMARK(QelExponentialLowerNearThreshold);
BENCHMARK(BoostExponentialLowerNearThreshold);
