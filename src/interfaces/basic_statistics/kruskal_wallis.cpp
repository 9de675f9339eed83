// Kruskal-Wallis (1952) one-way analysis of variance on ranks: H is the
// weighted sum of squared standardised mean ranks, referred to chi-square on
// k - 1 degrees of freedom, with the usual correction for ties.
#include <omp.h>
#include <qel/distributions.h>
#include <qel/rank_tests.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <new>
#include <vector>

namespace qel {
namespace v0 {

namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

void initializeKruskalWallis(KruskalWallis* record) {
  record->statistic = record->degreesOfFreedom = record->pValue = kNaN;
  record->adjustedStatistic = record->adjustedPValue = kNaN;
  for (unsigned int g = 0; g < record->groupCount; ++g) {
    KruskalWallisGroup& group = record->groups[g];
    group.median = group.meanRank = group.z = kNaN;
  }
}

// Ranks of all observations, accumulated as rank sums into meanRank; ties
// (values within a tolerance of the first of their run) share the average
// rank. Returns the tie sum of m (m^2 - 1) over the runs. The observations
// are sorted as (value, group) pairs: contiguous, so the sort does not chase
// an index into the data (three times faster on 1e7 values than an index
// sort, and less memory).
double rankSums(KruskalWallis* record, std::size_t total) {
  struct Observation {
    double value;
    unsigned int group;
  };
  std::vector<Observation> all;
  all.reserve(total);
  for (unsigned int g = 0; g < record->groupCount; ++g) {
    KruskalWallisGroup& group = record->groups[g];
    group.meanRank = 0.0;
    for (unsigned int i = 0; i < group.n; ++i) all.push_back({group.data[i], g});
  }
  std::sort(all.begin(), all.end(),
            [](Observation const& a, Observation const& b) { return a.value < b.value; });
  const double base =
      8.881784197001253e-17 * std::max(std::fabs(all.front().value), std::fabs(all.back().value));
  double ties = 0.0;
  for (std::size_t p = 0; p < total;) {
    const double v = all[p].value;
    const double tolerance = std::max(base, 8.881784197001252e-16 * std::fabs(v));
    std::size_t q = p + 1;
    while (q < total && all[q].value < v + tolerance) ++q;
    const double m = static_cast<double>(q - p);
    if (q - p > 1) ties += m * (m * m - 1.0);
    const double rank = q - p > 1 ? (p + q + 1) * 0.5 : p + 1.0;
    for (std::size_t i = p; i < q; ++i) record->groups[all[i].group].meanRank += rank;
    p = q;
  }
  return ties;
}

// The median of n values by selection, without touching the caller's data.
double groupMedian(double const* data, unsigned int n) {
  std::vector<double> copy(data, data + n);
  const std::size_t middle = n / 2;
  std::nth_element(copy.begin(), copy.begin() + middle, copy.end());
  double value = copy[middle];
  if (n % 2 == 0) value = 0.5 * (value + *std::max_element(copy.begin(), copy.begin() + middle));
  return value;
}

int legacyRunKruskalWallis(KruskalWallis* record) {
  initializeKruskalWallis(record);
  std::size_t total = 0;
  for (unsigned int g = 0; g < record->groupCount; ++g) total += record->groups[g].n;
  if (total == 0) return qelFailDegenerateData;
  const double ties = rankSums(record, total);
  const double N = static_cast<double>(total);
  const double middle = (N + 1.0) * 0.5;
  const double variance = (N + 1.0) / 12.0;
  const long groups = static_cast<long>(record->groupCount);
  const bool forkAllowed = !omp_in_parallel();
  int successes = 0;
  double h = 0.0;
#pragma omp parallel if (forkAllowed)
  {
#pragma omp for schedule(static) reduction(+ : successes)
    for (long g = 0; g < groups; ++g) {
      KruskalWallisGroup& group = record->groups[g];
      if (group.n == 0) {
        ++successes;
        continue;
      }
      try {
        group.median = groupMedian(group.data, group.n);
        ++successes;
      } catch (std::bad_alloc const&) {
        // counted as a failure through the reduction
      }
    }
#pragma omp for schedule(static) reduction(+ : h)
    for (long g = 0; g < groups; ++g) {
      KruskalWallisGroup& group = record->groups[g];
      if (group.n == 0) continue;
      const double n = group.n;
      group.meanRank /= n;
      group.z = (group.meanRank - middle) / std::sqrt(variance * (N - n) / n);
      if (N > n) h += ((N - n) / N) * group.z * group.z;
    }
  }
  record->statistic = h;
  record->degreesOfFreedom = static_cast<double>(record->groupCount) - 1.0;
  record->pValue = ChiSqPValue(h, record->degreesOfFreedom, kAlternativeGreater);
  if (ties == 0.0) {
    record->adjustedPValue = -1.0;
  } else {
    record->adjustedStatistic = h / (1.0 - ties / (N * (N * N - 1.0)));
    record->adjustedPValue =
        ChiSqPValue(record->adjustedStatistic, record->degreesOfFreedom, kAlternativeGreater);
  }
  return successes < groups ? qelFailOutOfMemory : qelOk;
}

}  // namespace

KruskalWallis::KruskalWallis()
    : statistic(kNaN),
      degreesOfFreedom(kNaN),
      pValue(kNaN),
      adjustedStatistic(kNaN),
      adjustedPValue(kNaN),
      groups(nullptr),
      groupCount(0) {}

int RunLynKruskalWallis(KruskalWallis* record) {
  try {
    return legacyRunKruskalWallis(record);
  } catch (std::bad_alloc const&) {
    return qelFailOutOfMemory;
  }
}

}  // namespace v0
}  // namespace qel
