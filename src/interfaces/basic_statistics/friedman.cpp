// Friedman's (1937) test for a randomised block design on ranks within
// blocks, with the treatment effects of Doksum (1967): e_i is the average
// over j of the median across blocks of x_i - x_j; block effects are the
// medians of the residuals within a block.
#include <omp.h>
#include <qel/distributions.h>
#include <qel/rank_tests.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <new>
#include <numeric>
#include <vector>

namespace qel {
namespace v0 {

namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

void initializeFriedman(Friedman* record) {
  record->grandMedian = record->statistic = record->degreesOfFreedom = kNaN;
  record->pValue = record->adjustedStatistic = record->adjustedPValue = kNaN;
  const long k = static_cast<long>(record->treatmentCount);
#pragma omp parallel for schedule(static) if (!omp_in_parallel())
  for (long i = 0; i < k; ++i) {
    record->treatments[i].estimatedMedian = kNaN;
    record->treatments[i].rankSum = kNaN;
  }
}

// The median of the values in [first, last) by selection (reorders them).
double selectMedian(double* first, double* last) {
  const std::ptrdiff_t n = last - first;
  double* middle = first + n / 2;
  std::nth_element(first, middle, last);
  double value = *middle;
  if (n % 2 == 0) value = 0.5 * (value + *std::max_element(first, middle));
  return value;
}

// Ranks within each block into the rank sums; returns the tie sum of
// m (m^2 - 1) over the runs of values within the tolerance of their first.
double doLegacyRankStuff(Friedman const* record, double tolerance, std::vector<double>& rankSums) {
  const unsigned int k = record->treatmentCount;
  std::vector<unsigned int> order(k);
  double ties = 0.0;
  for (unsigned int t = 0; t < record->blocks; ++t) {
    auto value = [&](unsigned int i) { return record->treatments[i].column[t]; };
    std::iota(order.begin(), order.end(), 0u);
    std::sort(order.begin(), order.end(),
              [&](unsigned int a, unsigned int b) { return value(a) < value(b); });
    for (unsigned int p = 0; p < k;) {
      unsigned int q = p + 1;
      while (q < k && !(value(order[q]) > value(order[p]) + tolerance)) ++q;
      const double m = q - p;
      if (q - p > 1) ties += m * (m * m - 1.0);
      const double rank = q - p > 1 ? (p + q + 1) * 0.5 : p + 1.0;
      for (unsigned int i = p; i < q; ++i) rankSums[order[i]] += rank;
      p = q;
    }
  }
  return ties;
}

// Treatment and block effects; overwrites the columns with fitted values.
// Returns the number of threads that ran out of memory.
int doLegacyEffectStuff(Friedman* record) {
  const long k = static_cast<long>(record->treatmentCount);
  const long b = static_cast<long>(record->blocks);
  std::vector<double> effect(static_cast<std::size_t>(k), 0.0);
  std::vector<double> d(static_cast<std::size_t>(b));
  for (long i = 0; i < k; ++i) {
    for (long j = i + 1; j < k; ++j) {
      for (long t = 0; t < b; ++t) {
        d[t] = record->treatments[i].column[t] - record->treatments[j].column[t];
      }
      const double z = selectMedian(d.data(), d.data() + b);
      // Running means over j of Z(i, j), with Z(i, i) = 0 and Z(j, i) = -Z(i, j).
      effect[i] += (z - effect[i]) / (j + 1.0);
      effect[j] += -(z + effect[j]) / (i + 2.0);
    }
  }
  std::vector<double> residuals(static_cast<std::size_t>(k * b));
  std::vector<double> blockMedian(static_cast<std::size_t>(b));
  int failures = 0;
#pragma omp parallel if (!omp_in_parallel()) reduction(+ : failures)
  {
#pragma omp for schedule(static)
    for (long i = 0; i < k; ++i) {
      for (long t = 0; t < b; ++t)
        residuals[i * b + t] = record->treatments[i].column[t] - effect[i];
    }
#pragma omp for schedule(static)
    for (long t = 0; t < b; ++t) {
      try {
        std::vector<double> across(static_cast<std::size_t>(k));
        for (long i = 0; i < k; ++i) across[i] = residuals[i * b + t];
        blockMedian[t] = selectMedian(across.data(), across.data() + k);
      } catch (std::bad_alloc const&) {
        ++failures;
        blockMedian[t] = kNaN;
      }
    }
#pragma omp for schedule(static)
    for (long i = 0; i < k; ++i) {
      for (long t = 0; t < b; ++t) record->treatments[i].column[t] = blockMedian[t] + effect[i];
    }
#pragma omp master
    {
      try {
        std::vector<double> copy(blockMedian);
        record->grandMedian = selectMedian(copy.data(), copy.data() + b);
      } catch (std::bad_alloc const&) {
        ++failures;
      }
    }
#pragma omp barrier
#pragma omp for schedule(static)
    for (long i = 0; i < k; ++i) {
      record->treatments[i].estimatedMedian = effect[i] + record->grandMedian;
    }
  }
  return failures;
}

int legacyRunFriedman(Friedman* record) {
  const unsigned int k = record->treatmentCount;
  const unsigned int b = record->blocks;
  if (k == 0 || b == 0) return qelFailDegenerateData;
  // Tolerance from the largest magnitude in the table.
  std::vector<double> extremes(2 * static_cast<std::size_t>(k));
  const long count = static_cast<long>(k);
#pragma omp parallel for schedule(static) if (!omp_in_parallel())
  for (long i = 0; i < count; ++i) {
    double const* column = record->treatments[i].column;
    auto range = std::minmax_element(column, column + b);
    extremes[2 * i] = -*range.first;
    extremes[2 * i + 1] = *range.second;
  }
  const double tolerance =
      *std::max_element(extremes.begin(), extremes.end()) * 8.881784197001253e-18;
  std::vector<double> rankSums(k, 0.0);
  const double ties = doLegacyRankStuff(record, tolerance, rankSums);
  const double expected = (b + static_cast<double>(k) * b) * 0.5;
  double ss = 0.0;
#pragma omp parallel for schedule(static) reduction(+ : ss) if (!omp_in_parallel())
  for (long i = 0; i < count; ++i) {
    record->treatments[i].rankSum = rankSums[i];
    ss += (rankSums[i] - expected) * (rankSums[i] - expected);
    rankSums[i] = 0.0;
  }
  record->statistic = 12.0 * ss / ((1.0 + k) * k * b);
  record->degreesOfFreedom = k - 1.0;
  record->pValue = ChiSqPValue(record->statistic, record->degreesOfFreedom, kAlternativeGreater);
  if (ties == 0.0) {
    record->adjustedPValue = -1.0;
  } else {
    const double c = ties / (static_cast<double>(k) * b * (static_cast<double>(k) * k - 1.0));
    record->adjustedStatistic = record->statistic / (1.0 - c);
    record->adjustedPValue =
        ChiSqPValue(record->adjustedStatistic, record->degreesOfFreedom, kAlternativeGreater);
  }
  return doLegacyEffectStuff(record) > 0 ? qelFailOutOfMemory : qelOk;
}

}  // namespace

Friedman::Friedman()
    : grandMedian(kNaN),
      statistic(kNaN),
      degreesOfFreedom(kNaN),
      pValue(kNaN),
      adjustedStatistic(kNaN),
      adjustedPValue(kNaN),
      treatments(nullptr),
      blocks(0),
      treatmentCount(0) {}

int RunLynFriedman(Friedman* record) {
  initializeFriedman(record);
  try {
    return legacyRunFriedman(record);
  } catch (std::bad_alloc const&) {
    return qelFailOutOfMemory;
  }
}

}  // namespace v0
}  // namespace qel
