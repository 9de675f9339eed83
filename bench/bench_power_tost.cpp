// Equivalence, factorial and one-way power, and the position sort tool.
// Peers on the same inputs: bench/peer_power.R (R's qt and pt for a TOST
// power, uniroot on the same power function for n, pf, power.anova.test)
// and std::stable_sort of an index vector for the sort tool.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdint>
#include <numeric>
#include <vector>

#include "basic_statistics/PowerFactorial.h"
#include "basic_statistics/PowerTOST.h"
#include "proxies/SortTool.h"

namespace {

void tost(qel::CmCmndPowerTOST& c) {
  c.mSetLimits(-1.0, 1.0);
  c.mSetAlternative(qel::kAlternativeNotEqual);
}

// Two independent samples of 20, difference 0.3, limits -1, 1.
void TOSTPower(benchmark::State& state) {
  for (auto _ : state) {
    benchmark::DoNotOptimize(
        qel::CmCmndPowerTOST::mTOSTPower(20, 0.3, 0.0, 0.05, 1.0, false, false, false, false, -1.0,
                                         1.0, qel::kTOSTTwoSample, qel::kAlternativeNotEqual));
  }
}
BENCHMARK(TOSTPower);

// n for difference 0.3 and power 0.8 (n = 22).
void TOSTSampleSize(benchmark::State& state) {
  for (auto _ : state) {
    qel::CmCmndPowerTOST c;
    tost(c);
    benchmark::DoNotOptimize(c.mCalcTOSTSampleSize(0.3, 0.8));
  }
}
BENCHMARK(TOSTSampleSize);

const std::vector<int> kSizes{20, 30, 40, 60, 80};
const std::vector<double> kPowers{0.5, 0.6, 0.7, 0.8, 0.9};

// 5 n x 5 powers of differences: the command's warm-started lists against
// 25 separate solves.
void TOSTDifferencesWarm(benchmark::State& state) {
  for (auto _ : state) {
    qel::CmCmndPowerTOST c;
    tost(c);
    c.mSetSampleSizes(kSizes);
    c.mSetPowers(kPowers);
    c.mComputeAndStore();
    benchmark::DoNotOptimize(c.mGetResultEffects().data());
  }
}
BENCHMARK(TOSTDifferencesWarm)->Unit(benchmark::kMicrosecond);

void TOSTDifferencesSeparate(benchmark::State& state) {
  for (auto _ : state) {
    for (int n : kSizes) {
      for (double p : kPowers) {
        qel::CmCmndPowerTOST c;
        tost(c);
        benchmark::DoNotOptimize(c.mCalcTOSTMeansDifference(p, n));
      }
    }
  }
}
BENCHMARK(TOSTDifferencesSeparate)->Unit(benchmark::kMicrosecond);

void factorial(qel::CmCmndPowerFactorial& c) {
  c.mSetFactorCt(4);
  c.mSetRunsPerRep(16);
}

// A 2^4 with 3 replicates, effect 1 (32 error df).
void FactorialPower(benchmark::State& state) {
  qel::CmCmndPowerFactorial c;
  factorial(c);
  for (auto _ : state) benchmark::DoNotOptimize(c.mPowerAt(3, 0, 1.0));
}
BENCHMARK(FactorialPower);

// Replicates of the 2^4 for effect 0.5, power 0.9.
void FactorialReplicates(benchmark::State& state) {
  for (auto _ : state) {
    qel::CmCmndPowerFactorial c;
    factorial(c);
    c.mSetCenterPoints({0});
    c.mSetEffects({0.5});
    c.mSetPowers({0.9});
    c.mComputeAndStore();
    benchmark::DoNotOptimize(c.mGetResultSampleSizes().data());
  }
}
BENCHMARK(FactorialReplicates);

// One-way, 4 groups, sum of squares of means 0.3: n for power 0.8 (38).
void OnewaySampleSize(benchmark::State& state) {
  qel::CmCmndPowerGFF c;
  c.mSetGroupCt(4);
  c.mSetLevels({4});
  for (auto _ : state) benchmark::DoNotOptimize(c.mComputeXForPowerAndEffect(0.8, 0.3));
}
BENCHMARK(OnewaySampleSize);

std::vector<double> values(std::size_t n) {
  std::vector<double> v(n);
  std::uint32_t seed = 99;
  for (auto& e : v) {
    seed = 1664525u * seed + 1013904223u;
    e = (seed >> 12) % 100000;  // ties, as in real columns
  }
  return v;
}

void SortToolDoubles(benchmark::State& state) {
  const auto v = values(1000000);
  qel::CmSortTool<double> tool;
  for (auto _ : state) {
    tool.mSort(v, true, true);
    benchmark::DoNotOptimize(tool.mGetSortedPositions().data());
  }
}
BENCHMARK(SortToolDoubles)->Unit(benchmark::kMillisecond);

void StdStableSortIndex(benchmark::State& state) {
  const auto v = values(1000000);
  std::vector<int> idx(v.size());
  for (auto _ : state) {
    std::iota(idx.begin(), idx.end(), 0);
    std::stable_sort(idx.begin(), idx.end(), [&](int a, int b) { return v[a] < v[b]; });
    benchmark::DoNotOptimize(idx.data());
  }
}
BENCHMARK(StdStableSortIndex)->Unit(benchmark::kMillisecond);

}  // namespace
