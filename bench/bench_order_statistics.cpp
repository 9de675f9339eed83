// Order statistics: the median of the Walsh averages (Hodges-Lehmann
// estimate) and of the pairwise differences found without forming them,
// against the brute force that forms every candidate and runs
// std::nth_element; and a sample quantile against std::nth_element.
// Each iteration includes sorting the sample and building the index, as a
// caller would.
#include <benchmark/benchmark.h>
#include <qel/descriptive.h>
#include <qel/order_statistics.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <numeric>
#include <vector>

#include "basic_statistics/NonparametricUtil.h"

namespace {

// Normal-looking data from a fixed linear congruential stream; `decimals`
// >= 0 rounds them, which makes ties.
std::vector<double> sample(std::size_t n, std::uint32_t seed, int decimals) {
  std::vector<double> x(n);
  std::uint32_t s = seed;
  auto uniform = [&s] {
    s = 1664525u * s + 1013904223u;
    return ((s >> 8) + 0.5) * 0x1p-24;
  };
  for (auto& v : x) {
    double u = uniform() + uniform() + uniform() + uniform() - 2.0;  // Irwin-Hall
    v = decimals >= 0 ? std::round(u * std::pow(10.0, decimals)) / std::pow(10.0, decimals) : u;
  }
  return x;
}

struct Prepared {
  std::vector<int> index, cumulative;
};

// Sort order with frequency 1 for every observation, as the rank tests use.
Prepared prepare(std::vector<double> const& x) {
  Prepared p;
  p.index.resize(x.size());
  std::iota(p.index.begin(), p.index.end(), 0);
  std::sort(p.index.begin(), p.index.end(), [&x](int a, int b) { return x[a] < x[b]; });
  p.cumulative.resize(x.size());
  std::iota(p.cumulative.begin(), p.cumulative.end(), 1);
  return p;
}

void WalshMedianSelection(benchmark::State& state) {
  std::size_t n = static_cast<std::size_t>(state.range(0));
  std::vector<double> x = sample(n, 2026, static_cast<int>(state.range(1)));
  double total = 0.5 * double(n) * double(n + 1);
  for (auto _ : state) {
    Prepared p = prepare(x);
    qel::CmSelectionBounds bounds;
    qel::mResetBoundsAvg(static_cast<int>(n), bounds);
    double k = std::floor((total + 1.0) * 0.5);
    double estimate =
        qel::mFinderAvg(p.index, x.data(), p.cumulative, bounds, 0.0, std::nan(""), k);
    benchmark::DoNotOptimize(estimate);
  }
  state.SetComplexityN(state.range(0));
}

void WalshMedianBruteForce(benchmark::State& state) {
  std::size_t n = static_cast<std::size_t>(state.range(0));
  std::vector<double> x = sample(n, 2026, static_cast<int>(state.range(1)));
  for (auto _ : state) {
    std::vector<double> averages;
    averages.reserve(n * (n + 1) / 2);
    for (std::size_t i = 0; i < n; ++i) {
      for (std::size_t j = i; j < n; ++j) averages.push_back((x[i] + x[j]) * 0.5);
    }
    auto middle = averages.begin() + (averages.size() - 1) / 2;
    std::nth_element(averages.begin(), middle, averages.end());
    benchmark::DoNotOptimize(*middle);
  }
}

// The rank k of an interval limit, the estimate and the other limit, in one
// rising sequence that resumes from the saved bounds.
void WalshIntervalAndEstimate(benchmark::State& state) {
  std::size_t n = static_cast<std::size_t>(state.range(0));
  std::vector<double> x = sample(n, 77, -1);
  double total = 0.5 * double(n) * double(n + 1);
  double k = std::floor(total * 0.5 - 1.96 * std::sqrt(n * (n + 1.0) * (2 * n + 1.0) / 24.0));
  for (auto _ : state) {
    Prepared p = prepare(x);
    qel::CmSelectionBounds bounds;
    qel::mResetBoundsAvg(static_cast<int>(n), bounds);
    double eliminated = 0.0, sum = 0.0;
    for (double rank : {k + 1, std::floor((total + 1) * 0.5), total - k}) {
      sum += qel::mFinderAvg(p.index, x.data(), p.cumulative, bounds, 0.0, std::nan(""),
                             rank - eliminated);
      eliminated = qel::mGetEliminatedAvg(p.cumulative, bounds);
    }
    benchmark::DoNotOptimize(sum);
  }
}

void DifferenceMedianSelection(benchmark::State& state) {
  std::size_t n = static_cast<std::size_t>(state.range(0));
  std::vector<double> x = sample(n, 5, 2), y = sample(n, 6, 2);
  for (auto& v : y) v += 0.25;
  for (auto _ : state) {
    Prepared px = prepare(x), py = prepare(y);
    qel::CmSelectionBounds bounds;
    qel::mResetBoundsDiff(static_cast<int>(n), static_cast<int>(n), bounds);
    double k = std::floor((double(n) * double(n) + 1.0) * 0.5);
    double shift = qel::mFinderDiff(px.index, x.data(), px.cumulative, py.index, y.data(),
                                    py.cumulative, bounds, 0.0, std::nan(""), k);
    benchmark::DoNotOptimize(shift);
  }
}

void DifferenceMedianBruteForce(benchmark::State& state) {
  std::size_t n = static_cast<std::size_t>(state.range(0));
  std::vector<double> x = sample(n, 5, 2), y = sample(n, 6, 2);
  for (auto& v : y) v += 0.25;
  for (auto _ : state) {
    std::vector<double> differences;
    differences.reserve(n * n);
    for (double xi : x) {
      for (double yj : y) differences.push_back(yj - xi);
    }
    auto middle = differences.begin() + (differences.size() - 1) / 2;
    std::nth_element(differences.begin(), middle, differences.end());
    benchmark::DoNotOptimize(*middle);
  }
}

constexpr unsigned kQuantileElements = 10000000;

void SampleQuantileType6(benchmark::State& state) {
  std::vector<double> x = sample(kQuantileElements, 9, 3);
  const double p[] = {0.25, 0.5, 0.75};
  for (auto _ : state) {
    double q[3];
    int code = qel::v1::GetSampleQuantiles(x.data(), kQuantileElements, 6, q, p, 3);
    benchmark::DoNotOptimize(code);
    benchmark::DoNotOptimize(q[1]);
  }
}

void QuantileNthElement(benchmark::State& state) {
  std::vector<double> x = sample(kQuantileElements, 9, 3);
  for (auto _ : state) {
    std::vector<double> copy = x;
    auto middle = copy.begin() + copy.size() / 2;
    std::nth_element(copy.begin(), middle, copy.end());
    benchmark::DoNotOptimize(*middle);
  }
}

// Average ranks of 1e7 values with ties (three decimals), against a bare
// sort of a copy of the same values.
void RanksWithTies(benchmark::State& state) {
  std::vector<double> x = sample(kQuantileElements, 11, 3);
  std::vector<double> rank(x.size());
  for (auto _ : state) {
    int code = qel::v1::GetRank(x.data(), static_cast<unsigned>(x.size()), rank.data());
    benchmark::DoNotOptimize(code);
    benchmark::DoNotOptimize(rank.data());
  }
}

void BareSort(benchmark::State& state) {
  std::vector<double> x = sample(kQuantileElements, 11, 3);
  for (auto _ : state) {
    std::vector<double> copy = x;
    std::sort(copy.begin(), copy.end());
    benchmark::DoNotOptimize(copy.data());
  }
}

}  // namespace

BENCHMARK(RanksWithTies)->Unit(benchmark::kMillisecond);
BENCHMARK(BareSort)->Unit(benchmark::kMillisecond);

// Second argument: decimals kept (-1: continuous data, 2: many ties).
BENCHMARK(WalshMedianSelection)
    ->ArgsProduct({{1000, 10000, 100000, 1000000}, {-1, 2}})
    ->Unit(benchmark::kMillisecond);
BENCHMARK(WalshMedianBruteForce)->ArgsProduct({{1000, 10000}, {-1}})->Unit(benchmark::kMillisecond);
BENCHMARK(WalshIntervalAndEstimate)
    ->Arg(1000)
    ->Arg(100000)
    ->Arg(1000000)
    ->Unit(benchmark::kMillisecond);
BENCHMARK(DifferenceMedianSelection)->Arg(1000)->Arg(100000)->Unit(benchmark::kMillisecond);
BENCHMARK(DifferenceMedianBruteForce)->Arg(1000)->Arg(10000)->Unit(benchmark::kMillisecond);
BENCHMARK(SampleQuantileType6)->Unit(benchmark::kMillisecond);
BENCHMARK(QuantileNthElement)->Unit(benchmark::kMillisecond);
