// Power and sample size: one power, the sample-size and effect solves of the
// t test, the two-proportion sample size, a 10 x 10 command solving n, and
// mMinMax over 1e7 rows in the all-rows and the list form. The peer numbers
// (R's power.t.test, power.prop.test and range on the same inputs) come from
// bench/peer_power.R, run in the same session.
#include <benchmark/benchmark.h>

#include <numeric>
#include <vector>

#include "basic_statistics/Power.h"
#include "proxies/rows.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"

namespace {

const double kMissing = qel::mGetMissingValueCode();
const auto kTwoSided = qel::kAlternativeNotEqual;

// power.t.test(n = 20, delta = 0.8, strict = TRUE)
void BM_TTwoSamplePower(benchmark::State& state) {
  for (auto _ : state) {
    benchmark::DoNotOptimize(
        qel::mTOneCalcOnePower(kTwoSided, 20, 0.8, 1.0, 0.05, false, true, kMissing));
  }
}
BENCHMARK(BM_TTwoSamplePower);

// power.t.test(delta = 0.5, power = 0.8, strict = TRUE): n = 64
void BM_TSampleSize(benchmark::State& state) {
  for (auto _ : state) {
    benchmark::DoNotOptimize(
        qel::mTCalcSampleSizeGivenPower(kTwoSided, 0.8, 0.5, 1.0, 0.05, false, true, false));
  }
}
BENCHMARK(BM_TSampleSize)->Unit(benchmark::kMicrosecond);

// power.t.test(n = 20, power = 0.8, delta = NULL, strict = TRUE)
void BM_TEffect(benchmark::State& state) {
  for (auto _ : state) {
    benchmark::DoNotOptimize(
        qel::mTComputeXForPowerAndSampleSize(0.8, 20, 1.0, kTwoSided, 0.05, false, true));
  }
}
BENCHMARK(BM_TEffect)->Unit(benchmark::kMicrosecond);

// power.prop.test(p1 = 0.3, p2 = 0.5, power = 0.8, strict = TRUE): n = 93
void BM_TwoProportionSampleSize(benchmark::State& state) {
  const double c = qel::mNormalCritValue(0.05, kTwoSided);
  for (auto _ : state) {
    benchmark::DoNotOptimize(
        qel::mCalcPOneSampleSizeGivenPower(kTwoSided, 0.8, 0.2, c, 0.3, false));
  }
}
BENCHMARK(BM_TwoProportionSampleSize)->Unit(benchmark::kMicrosecond);

// Effects 0.2, 0.4, ..., 2.0 by powers 0.5, 0.55, ..., 0.95, two samples.
void BM_TCommandSampleSizes10x10(benchmark::State& state) {
  std::vector<double> effects, powers;
  for (int i = 1; i <= 10; ++i) effects.push_back(0.2 * i);
  for (int i = 0; i < 10; ++i) powers.push_back(0.5 + 0.05 * i);
  for (auto _ : state) {
    qel::CmCmndPowerTAndZ c;
    c.mSetTwoSample(true);
    c.mSetEffects(effects);
    c.mSetPowers(powers);
    c.mComputeAndStore();
    benchmark::DoNotOptimize(c.mGetResultSampleSizes().data());
  }
}
BENCHMARK(BM_TCommandSampleSizes10x10)->Unit(benchmark::kMillisecond);

std::vector<double> column(std::size_t n) {
  std::vector<double> x(n);
  std::uint32_t seed = 12345;
  for (auto& v : x) {
    seed = 1664525u * seed + 1013904223u;
    v = static_cast<double>(seed >> 8) / 16777216.0;
  }
  return x;
}

void BM_MinMaxAllRows(benchmark::State& state) {
  const std::vector<double> x = column(10000000);
  qel::CbRows rows;
  rows.mUseAllRows(10000000);
  double lo = 0.0, hi = 0.0;
  for (auto _ : state) {
    qel::mMinMax(x, rows, &lo, &hi);
    benchmark::DoNotOptimize(lo + hi);
  }
}
BENCHMARK(BM_MinMaxAllRows)->Unit(benchmark::kMillisecond);

// Every other row, as a list (5e6 rows read through the list).
void BM_MinMaxRowList(benchmark::State& state) {
  const std::vector<double> x = column(10000000);
  std::vector<int> list(5000000);
  for (std::size_t i = 0; i < list.size(); ++i) list[i] = static_cast<int>(2 * i + 1);
  qel::CbRows rows;
  rows.mInitialize(list);
  double lo = 0.0, hi = 0.0;
  for (auto _ : state) {
    qel::mMinMax(x, rows, &lo, &hi);
    benchmark::DoNotOptimize(lo + hi);
  }
}
BENCHMARK(BM_MinMaxRowList)->Unit(benchmark::kMillisecond);

}  // namespace
