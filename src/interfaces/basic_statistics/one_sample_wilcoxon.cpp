// The Wilcoxon (1945) signed rank test with the Hodges and Lehmann (1963)
// estimate and interval. Ranks of Walsh averages are found without forming
// them, by the selection of Monahan (1984, ACM TOMS Algorithm 616); the
// statistic counts the Walsh sums above twice the hypothesised value, which
// equals the sum of the positive signed ranks (Tukey's identity).
#include <omp.h>
#include <qel/sign_tests.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <new>
#include <numeric>
#include <vector>

#include "basic_statistics/NonparametricUtil.h"
#include "interfaces/math/random_distributions_v1.h"

namespace qel {
namespace v0 {
namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr double kInfinity = std::numeric_limits<double>::infinity();

// The sample as the selection machinery wants it: positions in ascending
// order of value, every observation its own value (cumulative 1..n).
struct Ordered {
  std::vector<int> index;
  std::vector<int> cumulative;
  double tolerance = 0.0;
};

Ordered order(double const* x, int n) {
  Ordered o;
  o.index.resize(n);
  std::iota(o.index.begin(), o.index.end(), 0);
  std::sort(o.index.begin(), o.index.end(), [x](int a, int b) { return x[a] < x[b]; });
  o.cumulative.resize(n);
  std::iota(o.cumulative.begin(), o.cumulative.end(), 1);
  const double largest = std::fmax(std::fabs(x[o.index[0]]), std::fabs(x[o.index[n - 1]]));
  // Sums closer than a few units in the last place of the data are equal.
  o.tolerance = std::fmax(1e-12, 1.7763568394002505e-15 * largest);
  return o;
}

// Walsh averages of ascending ranks, each search resuming from the bounds of
// the one before.
class WalshRanks {
 public:
  WalshRanks(Ordered const& o, double const* x) : o_(o), x_(x) {
    mResetBoundsAvg(static_cast<int>(o.index.size()), bounds_);
  }
  double at(double rank) {
    const double value =
        mFinderAvg(o_.index, x_, o_.cumulative, bounds_, o_.tolerance, kNaN, rank - eliminated_);
    eliminated_ = mGetEliminatedAvg(o_.cumulative, bounds_);
    return value;
  }

 private:
  Ordered const& o_;
  double const* x_;
  CmSelectionBounds bounds_;
  double eliminated_ = 0.0;
};

void intervalAndEstimate(OneSampleWilcoxon* r, double const* x, int n, double confidence,
                         IntervalType type) {
  if (n < 1) return;
  if (n == 1) {
    r->estimatedMedian = x[0];
    return;
  }
  const Ordered o = order(x, n);
  const double T = 0.5 * n * (n + 1.0);
  const double sd = std::sqrt(n * (n + 1.0) * (2.0 * n + 1.0) / 24.0);
  const double alpha = type == kIntervalTwoSided ? 0.5 * (1.0 - confidence) : 1.0 - confidence;
  double k = v1::NormalInvCdf(alpha, 0.0, 1.0) * sd + 0.5 * T;
  k = k < 0.0 ? 0.0 : std::floor(k);  // NaN stays NaN
  if (k + 1.0 > 0.5 * T) k -= 1.0;
  const double p = v1::NormalCdf((k + 0.5 - 0.5 * T) / sd, 0.0, 1.0, false);
  r->achievedConfidence = type == kIntervalTwoSided ? 1.0 - 2.0 * p : 1.0 - p;
  WalshRanks walsh(o, x);
  if (type != kIntervalUpperBound) {
    r->lowerLimit = std::isnan(k) ? kNaN : walsh.at(k + 1.0);
    if (type == kIntervalLowerBound) r->upperLimit = kInfinity;
  }
  const double middle = std::floor((T + 1.0) * 0.5);
  const double estimate = walsh.at(middle);
  r->estimatedMedian =
      std::fmod(T, 2.0) == 0.0 ? 0.5 * (estimate + walsh.at(middle + 1.0)) : estimate;
  if (type != kIntervalLowerBound) {
    r->upperLimit = std::isnan(k) ? kNaN : walsh.at(T - k);
    if (type == kIntervalUpperBound) r->lowerLimit = -kInfinity;
  }
}

void signedRankTest(OneSampleWilcoxon* r, double const* x, int n, AlternativeHypothesis alternative,
                    double mu0) {
  if (n < 1) {
    r->n = 0;
    return;
  }
  const Ordered o = order(x, n);
  double zeros = 0.0, positive = 0.0;
  for (int i = 0; i < n; ++i) {
    if (std::fabs(x[i] - mu0) <= o.tolerance) {
      zeros += 1.0;
    } else if (x[i] > mu0) {
      positive += 1.0;
    }
  }
  r->n = n - static_cast<int>(zeros);
  if (r->n == 0) return;
  CmSelectionBounds bounds;
  mResetBoundsAvg(n, bounds);
  const CmBandWeights w = mBoundsAvg(o.index, x, o.cumulative, bounds, 2.0 * mu0, o.tolerance);
  // Drop the Walsh sums that involve an observation tied with mu0.
  r->W = 0.5 * w.band + w.above - (positive + (zeros + 1.0) * 0.25) * zeros;
  const double m = r->n * (r->n + 1.0) * 0.25;
  const double sd = std::sqrt(r->n * (r->n + 1.0) * (2.0 * r->n + 1.0) / 24.0);
  double c = 0.0;
  if (alternative == kAlternativeLess) {
    c = 0.5;
  } else if (alternative == kAlternativeGreater) {
    c = -0.5;
  } else {
    c = r->W > m ? -std::fmin(0.5, r->W - m) : std::fmin(0.5, m - r->W);
  }
  r->pValue = v1::NormalPValue((r->W + c - m) / sd, alternative);
}

bool validType(IntervalType type) {
  return type == kIntervalTwoSided || type == kIntervalLowerBound || type == kIntervalUpperBound;
}

}  // namespace

OneSampleWilcoxon::OneSampleWilcoxon()
    : estimatedMedian(kNaN),
      achievedConfidence(kNaN),
      lowerLimit(kNaN),
      upperLimit(kNaN),
      W(kNaN),
      pValue(kNaN),
      n(0) {}

int RunLynOneSampleWilcoxon(OneSampleWilcoxon* record, double const* x, double confidence,
                            IntervalType type) {
  if (!validType(type)) {
    record->lowerLimit = record->upperLimit = kNaN;
    return qelFailBadEnumValue;
  }
  try {
    intervalAndEstimate(record, x, record->n, confidence, type);
  } catch (std::bad_alloc const&) {
    return qelFailOutOfMemory;
  }
  return qelOk;
}

int RunLynOneSampleWilcoxon(OneSampleWilcoxon* record, double const* x, double confidence,
                            IntervalType type, AlternativeHypothesis alternative, double mu0) {
  OneSampleWilcoxon fresh;
  fresh.n = record->n;
  *record = fresh;
  if (!validType(type)) return qelFailBadEnumValue;
  // The interval and the test read the same sample and write disjoint
  // fields of the record: two independent sections. No exception may leave
  // a parallel region, so a failed allocation is counted instead.
  int failures = 0;
#pragma omp parallel sections reduction(+ : failures) if (!omp_in_parallel())
  {
#pragma omp section
    {
      try {
        intervalAndEstimate(record, x, fresh.n, confidence, type);
      } catch (std::bad_alloc const&) {
        ++failures;
      }
    }
#pragma omp section
    {
      try {
        signedRankTest(record, x, fresh.n, alternative, mu0);
      } catch (std::bad_alloc const&) {
        ++failures;
      }
    }
  }
  if (failures == 0) return qelOk;
  // Half a record would pass for a result: leave none.
  *record = fresh;
  return qelFailOutOfMemory;
}

}  // namespace v0
}  // namespace qel
