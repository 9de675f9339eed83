// Mood's (1950) median test: the counts of each group at or below and above
// the overall median, tested by Pearson's chi-square on the 2 x k table. The
// group medians get sign intervals interpolated after Hettmansperger and
// Sheather (1986); with two groups the difference of the medians gets an
// interval from two one-sample intervals whose confidences combine to 95%.
#include <omp.h>
#include <qel/distributions.h>
#include <qel/rank_tests.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <new>
#include <vector>

#include "interfaces/basic_statistics/sign_interval.h"

namespace qel {
namespace v0 {

namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr int kFlaggedWarning = 10000;  // a flag is set; the results are valid

void initializeMood(Mood* record) {
  record->overallMedian = record->statistic = record->degreesOfFreedom = kNaN;
  record->pValue = record->lowerLimit = record->upperLimit = record->achievedConfidence = kNaN;
  record->flags = 0;
  for (unsigned int g = 0; g < record->groupCount; ++g) {
    MoodGroup& group = record->groups[g];
    group.countAtOrBelow = group.countAbove = group.median = kNaN;
    group.interquartileRange = group.lowerLimit = group.upperLimit = kNaN;
  }
}

double medianOfSorted(std::vector<double> const& x) {
  const std::size_t n = x.size();
  return n % 2 ? x[n / 2] : 0.5 * (x[n / 2 - 1] + x[n / 2]);
}

// The quantile at position (n + 1) p of sorted values, interpolated.
double quantileOfSorted(std::vector<double> const& x, double p) {
  const int n = static_cast<int>(x.size());
  double whole;
  const double f = std::modf((n + 1) * p, &whole);
  const int g = static_cast<int>(whole);
  if (g < 1) return x[0];
  if (g >= n) return x[static_cast<std::size_t>(n - 1)];
  return (1.0 - f) * x[static_cast<std::size_t>(g - 1)] + f * x[static_cast<std::size_t>(g)];
}

// Interpolated sign interval of the median of sorted values.
void signInterval(std::vector<double> const& x, double confidence, double* lower, double* upper) {
  const int n = static_cast<int>(x.size());
  unsigned int d = 1;
  double lambda = 0.0;
  Sint(n, confidence, &d, &lambda);
  auto at = [&](int i) { return x[static_cast<std::size_t>(std::clamp(i, 0, n - 1))]; };
  const int k = static_cast<int>(d);
  *lower = (1.0 - lambda) * at(k - 1) + lambda * at(k);
  *upper = lambda * at(n - k - 1) + (1.0 - lambda) * at(n - k);
}

std::vector<double> sortedCopy(MoodGroup const& group) {
  std::vector<double> x(group.data, group.data + group.n);
  std::sort(x.begin(), x.end());
  return x;
}

// The interval of the difference of two medians from one-sample intervals
// at confidences 1 - 2 Phi(-y) and 1 - 2 Phi(-w), split so that
// a y + b w = z(0.975) and neither sample's rank falls below 1.
void twoSample(Mood* record) {
  MoodGroup const& first = record->groups[0];
  MoodGroup const& second = record->groups[1];
  const double n1 = first.n, n2 = second.n;
  const double z = -NormalInvCdf(0.025, 0.0, 1.0);
  const double p = n1 / (n1 + n2);
  const double a = std::sqrt(1.0 - p), b = std::sqrt(p);
  const double s1 = std::sqrt(n1), s2 = std::sqrt(n2);
  auto tooLarge = [](double n, double v, double s) { return 0.5 * n + 0.5 - v * s / 2.0 < 1.0; };
  double y = z * a;
  if (tooLarge(n1, y, s1)) y = (n1 - 1.0) / s1;
  double w = (z - a * y) / b;
  if (tooLarge(n2, w, s2)) {
    w = (n2 - 1.0) / s2;
    y = (z - b * w) / a;
    if (tooLarge(n1, y, s1)) y = (n1 - 1.0) / s1;
  }
  record->achievedConfidence = 1.0 - 2.0 * NormalCdf(-(a * y + b * w), 0.0, 1.0, false);
  const double confidence1 = 1.0 - 2.0 * NormalCdf(-y, 0.0, 1.0, false);
  const double confidence2 = 1.0 - 2.0 * NormalCdf(-w, 0.0, 1.0, false);
  double lower1 = kNaN, upper1 = kNaN, lower2 = kNaN, upper2 = kNaN;
  int failures = 0;
#pragma omp parallel sections reduction(+ : failures) if (!omp_in_parallel())
  {
#pragma omp section
    {
      try {
        signInterval(sortedCopy(first), confidence1, &lower1, &upper1);
      } catch (std::bad_alloc const&) {
        ++failures;
      }
    }
#pragma omp section
    {
      try {
        signInterval(sortedCopy(second), confidence2, &lower2, &upper2);
      } catch (std::bad_alloc const&) {
        ++failures;
      }
    }
  }
  if (failures > 0) throw std::bad_alloc();
  record->lowerLimit = lower1 - upper2;
  record->upperLimit = upper1 - lower2;
}

int legacyRunMood(Mood* record) {
  std::vector<double> all;
  for (unsigned int g = 0; g < record->groupCount; ++g) {
    all.insert(all.end(), record->groups[g].data, record->groups[g].data + record->groups[g].n);
  }
  if (all.empty()) return qelFailDegenerateData;
  std::sort(all.begin(), all.end());
  const long total = static_cast<long>(all.size());
  const double m = medianOfSorted(all);
  record->overallMedian = m;
  const double tol = 8.881784197001252e-16 *
                     (std::fabs(m) + std::max(std::fabs(all.front()), std::fabs(all.back())));
  long below = 0, above = 0;
  for (long i = (total - 1) / 2; i >= 0; --i) {
    if (m > all[i] + tol) {
      below = i + 1;
      break;
    }
  }
  for (long i = total / 2; i < total; ++i) {
    if (all[i] > m + tol) {
      above = total - i;
      break;
    }
  }
  const long k = static_cast<long>(record->groupCount);
  bool tiesHigh = false;
  if ((above < below && above < total / 3) || (above < k && above < below && below >= k)) {
    tiesHigh = true;
    record->flags |= kMoodTiesMovedUp;
  }
  if (!tiesHigh && above < k) record->flags |= kMoodFewAbove;
  if (tiesHigh && below < k) record->flags |= kMoodFewBelow;

  long countA = 0, countB = 0, counted = 0;
  int failures = 0;
  const long groups = k;
#pragma omp parallel for schedule(static) reduction(+ : countA, countB, counted, failures) \
    if (!omp_in_parallel())
  for (long g = 0; g < groups; ++g) {
    MoodGroup& group = record->groups[g];
    if (group.n == 0) continue;
    try {
      std::vector<double> x = sortedCopy(group);
      group.interquartileRange = quantileOfSorted(x, 0.75) - quantileOfSorted(x, 0.25);
      group.median = medianOfSorted(x);
      signInterval(x, 0.95, &group.lowerLimit, &group.upperLimit);
    } catch (std::bad_alloc const&) {
      ++failures;
    }
    long low = 0, high = 0;
    for (unsigned int i = 0; i < group.n; ++i) {
      const double v = group.data[i];
      const bool up = tiesHigh ? !(m > v + tol) : v > m + tol;
      (up ? high : low) += 1;
    }
    group.countAtOrBelow = static_cast<double>(low);
    group.countAbove = static_cast<double>(high);
    if (group.n > 1) {
      countA += low;
      countB += high;
      counted += 1;
    }
  }
  record->degreesOfFreedom = static_cast<double>(counted) - 1.0;
  const double A = static_cast<double>(countA), B = static_cast<double>(countB);
  double chi = 0.0;
#pragma omp parallel for schedule(static) reduction(+ : chi) if (!omp_in_parallel())
  for (long g = 0; g < groups; ++g) {
    MoodGroup const& group = record->groups[g];
    if (group.n < 2) continue;
    const double e1 = A * group.n / (A + B), e2 = B * group.n / (A + B);
    const double d1 = group.countAtOrBelow - e1, d2 = group.countAbove - e2;
    chi += d1 * d1 / e1 + d2 * d2 / e2;
  }
  if (counted < 2) {
    // No group of two or more: there is no chi-square (flag 8 below), and
    // the degrees of freedom are not -1 or 0 but absent.
    record->degreesOfFreedom = kNaN;
  } else {
    record->statistic = chi;
    record->pValue = ChiSqPValue(chi, record->degreesOfFreedom, kAlternativeGreater);
  }
  if (record->groupCount == 2 && record->groups[0].n > 0 && record->groups[1].n > 0) {
    twoSample(record);
  }
  if (!(record->degreesOfFreedom > 0.0)) record->flags |= kMoodNoDegrees;
  if (failures > 0) return qelFailOutOfMemory;
  return record->flags != 0 ? kFlaggedWarning : qelOk;
}

}  // namespace

void Sint(int n, double confidence, unsigned int* d, double* lambda) {
  double c = 1.0 - std::pow(0.5, n - 1);
  *d = 1;
  *lambda = 0.0;
  if (confidence >= c) return;
  double next = c;
  for (int i = 1; i <= n / 2; ++i) {
    next = n <= 50
               ? c - 2.0 * BinomialPdf(i, n, 0.5)
               : 1.0 - 2.0 * NormalCdf((i + 0.5 - n / 2.0) / std::sqrt(n / 4.0), 0.0, 1.0, false);
    *d = static_cast<unsigned int>(i);
    if (next <= confidence && confidence <= c) break;
    c = next;
  }
  const double share = (c - confidence) / (c - next);
  const double dd = *d;
  *lambda = (n - dd) * share / (dd + (n - 2.0 * dd) * share);
}

Mood::Mood()
    : overallMedian(kNaN),
      statistic(kNaN),
      degreesOfFreedom(kNaN),
      pValue(kNaN),
      lowerLimit(kNaN),
      upperLimit(kNaN),
      achievedConfidence(kNaN),
      groups(nullptr),
      groupCount(0),
      flags(0) {}

int RunLynMood(Mood* record) {
  initializeMood(record);
  try {
    return legacyRunMood(record);
  } catch (std::bad_alloc const&) {
    return qelFailOutOfMemory;
  }
}

}  // namespace v0
}  // namespace qel
