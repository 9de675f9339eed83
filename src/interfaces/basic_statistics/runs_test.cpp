// The runs test about a value (Wald and Wolfowitz, 1940): the number of runs
// above and below k against its distribution given the two counts, exact
// (Swed and Eisenhart, 1943) or by its normal approximation.
#include <omp.h>
#include <qel/sign_tests.h>

#include <cmath>
#include <limits>

#include "interfaces/math/random_distributions_v1.h"
#include "utilities/MathUtilities.h"

namespace qel {
namespace v1 {
namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

// log C(n, k), minus infinity outside 0 <= k <= n.
double logChoose(int n, int k) {
  if (k < 0 || n < 0 || k > n) return -std::numeric_limits<double>::infinity();
  return mLogNChooseK(n, k);
}

// exp of a log probability that may be minus infinity (an empty class).
double expOrZero(double logP) {
  return std::isinf(logP) ? 0.0 : std::exp(logP);
}

// P(R = r) for n1 and n2 observations in the two classes.
double runsProbability(unsigned r, int n1, int n2, double logTotal) {
  if (r % 2 == 0) {
    const int h = static_cast<int>(r / 2) - 1;
    return 2.0 * expOrZero(logChoose(n1 - 1, h) + logChoose(n2 - 1, h) - logTotal);
  }
  const int h = static_cast<int>((r - 1) / 2);
  return expOrZero(logChoose(n1 - 1, h) + logChoose(n2 - 1, h - 1) - logTotal) +
         expOrZero(logChoose(n1 - 1, h - 1) + logChoose(n2 - 1, h) - logTotal);
}

}  // namespace

RunsTest::RunsTest()
    : countBelow(0), countAbove(0), observedRuns(0), expectedRuns(kNaN), pValue(kNaN) {}

int CreateRunsTestStatistics(RunsTest* record, double const* x, double k, unsigned n) {
  *record = RunsTest();
  unsigned i = 0;
  while (i < n && x[i] == k) ++i;
  if (i == n) return qelOk;
  bool above = x[i] > k;
  unsigned runs = 1, countAbove = 0, total = 0;
  for (; i < n; ++i) {
    if (x[i] == k) continue;
    const bool side = x[i] > k;
    if (side != above) ++runs;
    above = side;
    if (side) ++countAbove;
    ++total;
  }
  record->countAbove = countAbove;
  record->countBelow = total - countAbove;
  record->observedRuns = runs;
  record->expectedRuns = 2.0 * countAbove * record->countBelow / total + 1.0;
  return qelOk;
}

int RunLynRunsTest(RunsTest* record, double const* x, double k, unsigned n) {
  CreateRunsTestStatistics(record, x, k, n);
  const double m = static_cast<double>(record->countAbove) + record->countBelow;
  const double A = 2.0 * record->countAbove * record->countBelow;
  if (!(m > 1.0)) return qelOk;
  const double variance = A * (A - m) / (m * m * (m - 1.0));
  if (variance > 0.0) {
    record->pValue = NormalPValue(
        (record->observedRuns - record->expectedRuns) / std::sqrt(variance), kAlternativeNotEqual);
  }
  return qelOk;
}

int RunRunsTest(RunsTest* record, double const* x, double k, unsigned n) {
  CreateRunsTestStatistics(record, x, k, n);
  const int n1 = static_cast<int>(record->countBelow);
  const int n2 = static_cast<int>(record->countAbove);
  // One class only: a single run is certain and says nothing.
  if (n1 == 0 || n2 == 0) return qelOk;
  const unsigned m = record->countBelow + record->countAbove;
  const double logTotal = logChoose(n1 + n2, n1);
  // The two tails are independent sums of point probabilities: one section
  // each.
  double lower = 0.0, upper = 0.0;
#pragma omp parallel sections if (!omp_in_parallel())
  {
#pragma omp section
    {
      for (unsigned r = 2; r <= record->observedRuns; ++r)
        lower += runsProbability(r, n1, n2, logTotal);
    }
#pragma omp section
    {
      for (unsigned r = record->observedRuns; r <= m; ++r)
        upper += runsProbability(r, n1, n2, logTotal);
    }
  }
  record->pValue = std::fmin(1.0, 2.0 * std::fmin(lower, upper));
  return qelOk;
}

}  // namespace v1
}  // namespace qel
