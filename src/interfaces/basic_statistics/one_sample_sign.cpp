// The sign test and its interval of the median. The interval has three rows:
// the two order-statistic intervals whose binomial coverage brackets the
// requested confidence, and between them the nonlinear interpolation of
// Hettmansperger, T. P. and Sheather, S. J. (1986), Statistics & Probability
// Letters 4, 75-79 (shared with the boxplot helper).
#include <qel/distributions.h>
#include <qel/order_statistics.h>
#include <qel/sign_tests.h>

#include <cmath>
#include <limits>
#include <new>
#include <vector>

#include "interfaces/basic_statistics/order_statistics.h"
#include "interfaces/basic_statistics/summaries.h"
#include "interfaces/math/random_distributions_v1.h"

namespace qel {
namespace v0 {
namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr double kInfinity = std::numeric_limits<double>::infinity();
constexpr unsigned int kLargestExactSample = 50;

// The law of the number of observations below the median: its depth d for a
// two-sided confidence and its lower-tail cdf.
struct SignLaw {
  bool normal;
  unsigned int n;
  double depth(double confidence) const {
    if (!normal) return std::trunc(v1::BinomialInvCdf((1.0 - confidence) * 0.5, n, 0.5));
    const double sd = 0.5 * std::sqrt(static_cast<double>(n));
    return std::floor(v1::NormalInvCdf((1.0 - confidence) * 0.5, 0.5 * n, sd) + 0.5);
  }
  double cdf(double k) const {
    if (!normal) return v1::BinomialCdf(k, n, 0.5, false);
    const double sd = 0.5 * std::sqrt(static_cast<double>(n));
    return v1::NormalCdf(k + 0.5, 0.5 * n, sd, false);
  }
};

void clearLimits(OneSampleSign* r) {
  r->narrowerLowerLimit = r->interpolatedLowerLimit = r->widerLowerLimit = kNaN;
  r->narrowerUpperLimit = r->interpolatedUpperLimit = r->widerUpperLimit = kNaN;
}

// The two-sided rows at confidence c from the sorted sample s.
int twoSidedRows(OneSampleSign* r, double const* s, double c, SignLaw const& law) {
  const unsigned int n = r->n;
  const double d = law.depth(c);
  if (!(d >= 0.0) || d > n) return qelOk;  // NaN confidence or quantile
  const auto k = static_cast<unsigned int>(d);
  if (k == 0) {
    r->narrowerLowerLimit = s[0];
    r->narrowerUpperLimit = s[n - 1];
    r->narrowerPosition = 1.0;
    r->narrowerConfidence = 1.0 - 2.0 * law.cdf(0.0);
    return 10001;
  }
  if (law.normal) {
    v1::ApproximateTwoSidedCI(&r->interpolatedLowerLimit, &r->interpolatedUpperLimit, c, s, n);
  } else {
    v1::ExactTwoSidedCI(&r->interpolatedLowerLimit, &r->interpolatedUpperLimit, c, s, n);
  }
  r->widerLowerLimit = s[k - 1];
  r->widerUpperLimit = s[n - k];
  r->widerPosition = d;
  r->widerConfidence = 1.0 - 2.0 * law.cdf(d - 1.0);
  if (2.0 * d >= n) return 10002;
  r->narrowerLowerLimit = s[k];
  r->narrowerUpperLimit = s[n - k - 1];
  r->narrowerPosition = d + 1.0;
  r->narrowerConfidence = 1.0 - 2.0 * law.cdf(d);
  return qelOk;
}

// One-sided intervals run the two-sided rows at 1 - 2(1 - c), then drop one
// side and give the achieved confidences back as one-sided values.
int createCI(OneSampleSign* r, double const* s, double confidence, IntervalType type,
             SignLaw const& law) {
  if (type != kIntervalTwoSided && type != kIntervalLowerBound && type != kIntervalUpperBound) {
    clearLimits(r);
    return qelFailBadEnumValue;
  }
  r->median = r->n == 0 ? kNaN : v1::GetTypicalMedian(s, r->n);
  const double c = type == kIntervalTwoSided ? confidence : 1.0 - 2.0 * (1.0 - confidence);
  const int code = twoSidedRows(r, s, c, law);
  if (type == kIntervalTwoSided) return code;
  r->narrowerConfidence = 1.0 - (1.0 - r->narrowerConfidence) * 0.5;
  r->widerConfidence = 1.0 - (1.0 - r->widerConfidence) * 0.5;
  if (type == kIntervalLowerBound) {
    r->narrowerUpperLimit = r->interpolatedUpperLimit = r->widerUpperLimit = kInfinity;
  } else {
    r->narrowerLowerLimit = r->interpolatedLowerLimit = r->widerLowerLimit = -kInfinity;
    if (law.normal) {
      // Positions counted from the upper end of the sample.
      if (!std::isnan(r->narrowerPosition)) r->narrowerPosition = r->n - r->widerPosition;
      if (!std::isnan(r->widerPosition)) r->widerPosition = r->n - r->widerPosition + 1.0;
    }
  }
  return code;
}

// Counts about mu0 and the P-value of the count above it among the
// observations not equal to mu0; 1 when there are none.
void signTest(OneSampleSign* r, double const* x, AlternativeHypothesis alternative, double mu0,
              bool normal) {
  unsigned int below = 0, above = 0;
  for (unsigned int i = 0; i < r->n; ++i) {
    if (x[i] < mu0) ++below;
    if (x[i] > mu0) ++above;
  }
  r->countBelow = below;
  r->countAbove = above;
  r->countEqual = r->n - below - above;
  const unsigned int total = below + above;
  if (total == 0) {
    r->pValue = 1.0;
  } else if (!normal) {
    r->pValue = BinomialPValue(above, static_cast<int>(total), 0.5, alternative);
  } else {
    // Continuity correction toward the centre, never past it.
    const double half = 0.5 * total;
    double c = 0.0;
    if (alternative == kAlternativeLess) {
      c = 0.5;
    } else if (alternative == kAlternativeGreater) {
      c = -0.5;
    } else {
      c = above > half ? -std::fmin(0.5, above - half) : std::fmin(0.5, half - above);
    }
    r->pValue = v1::NormalPValue((above + c - half) / std::sqrt(total * 0.25), alternative);
  }
}

int run(OneSampleSign* r, double const* x, double confidence, IntervalType type, bool test,
        AlternativeHypothesis alternative, double mu0, bool lyn) {
  InitializeOneSampleSign(r);
  const SignLaw law{lyn && r->n > kLargestExactSample, r->n};
  try {
    const std::vector<double> sorted = v1::mSortedCopy(x, r->n);
    const int code = createCI(r, sorted.data(), confidence, type, law);
    if (code == qelFailBadEnumValue || !test) return code;
    signTest(r, x, alternative, mu0, law.normal);
    return code;
  } catch (std::bad_alloc const&) {
    return qelFailOutOfMemory;
  }
}

}  // namespace

void InitializeOneSampleSign(OneSampleSign* r) {
  const unsigned int n = r->n;
  double* fields[] = {&r->median,
                      &r->narrowerConfidence,
                      &r->widerConfidence,
                      &r->narrowerLowerLimit,
                      &r->interpolatedLowerLimit,
                      &r->widerLowerLimit,
                      &r->narrowerUpperLimit,
                      &r->interpolatedUpperLimit,
                      &r->widerUpperLimit,
                      &r->narrowerPosition,
                      &r->widerPosition,
                      &r->pValue,
                      &r->countBelow,
                      &r->countEqual,
                      &r->countAbove};
  for (double* f : fields) *f = kNaN;
  r->n = n;
}

int RunOneSampleSign(OneSampleSign* record, double const* x, double confidence, IntervalType type) {
  return run(record, x, confidence, type, false, kAlternativeNotEqual, 0.0, false);
}

int RunOneSampleSign(OneSampleSign* record, double const* x, double confidence, IntervalType type,
                     AlternativeHypothesis alternative, double mu0) {
  return run(record, x, confidence, type, true, alternative, mu0, false);
}

int RunLynOneSampleSign(OneSampleSign* record, double const* x, double confidence,
                        IntervalType type) {
  return run(record, x, confidence, type, false, kAlternativeNotEqual, 0.0, true);
}

int RunLynOneSampleSign(OneSampleSign* record, double const* x, double confidence,
                        IntervalType type, AlternativeHypothesis alternative, double mu0) {
  return run(record, x, confidence, type, true, alternative, mu0, true);
}

}  // namespace v0
}  // namespace qel
