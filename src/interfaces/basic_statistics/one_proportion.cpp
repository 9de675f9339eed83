// One binomial proportion: Wald, Wilson score (Wilson, 1927; continuity
// corrected as Newcombe, 1998, method 4), Clopper-Pearson (1934),
// Agresti-Coull (1998) and mid-P (Lancaster, 1961) intervals; the z, score,
// exact and mid-P tests.
#include <qel/proportion_tests.h>

#include <algorithm>
#include <cmath>
#include <limits>

#include "interfaces/basic_statistics/proportions.h"
#include "interfaces/basic_statistics/utilities.h"
#include "interfaces/math/random_distributions_v0.h"
#include "interfaces/math/random_distributions_v1.h"

namespace qel {
namespace v0 {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

bool isKnown(AlternativeHypothesis alternative) {
  return alternative == kAlternativeLess || alternative == kAlternativeNotEqual ||
         alternative == kAlternativeGreater;
}

int badType(double* lower, double* upper) {
  *lower = kNaN;
  *upper = kNaN;
  return qelFailBadEnumValue;
}

// The intervals that are not of the form centre -/+ z times a scale refuse a
// confidence outside (0, 1) as the symmetric ones do: at 0 or 1 (or NaN) the
// tail equations have no interior root and the limits would cross.
bool badConfidence(double confidence) {
  return !(confidence > 0.0 && confidence < 1.0);
}

// Clopper-Pearson limits from beta quantiles; x = 0 passes a shape of 0 to
// the quantile, whose answer stands.
int exactLimits(double x, double n, double confidence, IntervalType type, double* lower,
                double* upper) {
  if (badConfidence(confidence)) return badType(lower, upper);
  switch (type) {
    case kIntervalUpperBound:
      *lower = 0.0;
      *upper = v1::BetaInvCdf(confidence, x + 1.0, n - x);
      return qelOk;
    case kIntervalTwoSided:
      *lower = v1::BetaInvCdf((1.0 - confidence) * 0.5, x, n - x + 1.0);
      *upper = v1::BetaInvCdf((1.0 + confidence) * 0.5, x + 1.0, n - x);
      return qelOk;
    case kIntervalLowerBound:
      *lower = v1::BetaInvCdf(1.0 - confidence, x, n - x + 1.0);
      *upper = 1.0;
      return qelOk;
  }
  return badType(lower, upper);
}

double waldError(double p, double n) {
  return RootOrNaN((1.0 - p) * p / n);
}

double zStatistic(double x, double n, double p0, double correction) {
  return (x - n * p0 + correction) / RootOrNaN((1.0 - p0) * (n * p0));
}

// Both tails hold the observed count; the upper one is computed as a tail of
// its own rather than 1 - L + f, which cancels when L is near 1.
void tails(unsigned int x, unsigned int n, double p0, double* lower, double* upper) {
  *lower = v1::BinomialCdf(x, n, p0, false);
  *upper = v1::BinomialCdf(x, n, p0, true);
}

// The exact P-value; the two-sided one is twice the smaller tail, at most 1.
int exactTest(OneProportion* r, AlternativeHypothesis alternative, double p0) {
  if (!isKnown(alternative)) return qelFailBadEnumValue;
  double lower, upper;
  tails(r->events, r->trials, p0, &lower, &upper);
  if (alternative == kAlternativeLess) {
    r->pValue = lower;
  } else if (alternative == kAlternativeGreater) {
    r->pValue = upper;
  } else {
    r->pValue = std::min(1.0, 2.0 * std::min(lower, upper));
  }
  return qelOk;
}

// Mid-P tail less alpha at p: increasing in p for the lower bound,
// decreasing for the upper; *slope gets its derivative.
double midPEquation(bool lowerBound, unsigned int x, unsigned int n, double p, double alpha,
                    double* slope) {
  const double f = v1::BinomialPdf(x, n, p);
  // g = pdf(x; n-1, p) + pdf(x-1; n-1, p) = f ((n-x)/(n(1-p)) + x/(n p)),
  // each term taken from f by the ratio of the masses; at p = 0 or 1 only
  // the term that survives is formed directly.
  double g;
  if (p > 0.0 && p < 1.0) {
    g = f * ((n - static_cast<double>(x)) / (n * (1.0 - p)) + x / (n * p));
  } else {
    g = v1::BinomialPdf(x, n - 1, p) + (x > 0 ? v1::BinomialPdf(x - 1.0, n - 1, p) : 0.0);
  }
  const double tail = v1::BinomialCdf(x, n, p, lowerBound);
  *slope = (lowerBound ? 0.5 : -0.5) * n * g;
  return tail - 0.5 * f - alpha;
}

// The Wilson score limit at level alpha: close to the mid-P bound (the
// score interval approximates the mid-P one, Agresti and Gottard, 2007), so
// that Newton's method needs two or three binomial tails instead of five or
// six from x/n. x = 0 and x = n start from x/n, where the bound is exact.
double midPStart(bool lowerBound, unsigned int x, unsigned int n, double alpha) {
  const double p = static_cast<double>(x) / n;
  if (x == 0 || x == n || !(alpha > 0.0 && alpha < 0.5)) return p;
  const double z = NormalInvCdf(1.0 - alpha, 0.0, 1.0);
  const double z2 = z * z, d = n + z2;
  const double half = z * RootOrNaN((1.0 - p) * x + 0.25 * z2) / d;
  const double centre = (x + 0.5 * z2) / d;
  const double start = lowerBound ? centre - half : centre + half;
  return start > 0.0 && start < 1.0 ? start : p;
}

// Newton's method from midPStart, at most 50 steps, ending when a step is
// below 1e-12. The iterate stays in [0, 1] and in the bracket that the signs
// seen so far leave: a step that would leave it halves the bracket instead
// (a safeguarded Newton iteration, Press et al., Numerical Recipes, rtsafe),
// so that a flat tail cannot throw the iteration out of the root's branch.
double midPBound(bool lowerBound, unsigned int x, unsigned int n, double alpha) {
  if (n == 0 || x > n || !(alpha >= 0.0 && alpha <= 1.0)) return kNaN;
  double p = midPStart(lowerBound, x, n, alpha);
  double low = 0.0, high = 1.0;
  for (int step = 0; step < 50; ++step) {
    double slope = 0.0;
    const double h = midPEquation(lowerBound, x, n, p, alpha, &slope);
    if (std::isnan(h)) return kNaN;
    if (h == 0.0) break;
    if ((h > 0.0) == lowerBound) {
      high = p;
    } else {
      low = p;
    }
    double next = p - h / slope;
    if (!(next >= low && next <= high)) next = 0.5 * (low + high);
    const double change = next - p;
    p = next;
    if (std::fabs(change) < 1e-12) break;
  }
  return p;
}

int midPLimits(OneProportion* r, double confidence, IntervalType type) {
  const unsigned int x = r->events, n = r->trials;
  if (badConfidence(confidence)) return badType(&r->lowerLimit, &r->upperLimit);
  switch (type) {
    case kIntervalTwoSided: {
      const double alpha = (1.0 - confidence) * 0.5;
      r->upperLimit = midPBound(false, x, n, alpha);
      r->lowerLimit = midPBound(true, x, n, alpha);
      return qelOk;
    }
    case kIntervalLowerBound:
      r->lowerLimit = midPBound(true, x, n, 1.0 - confidence);
      r->upperLimit = 1.0;
      return qelOk;
    case kIntervalUpperBound:
      r->lowerLimit = 0.0;
      r->upperLimit = midPBound(false, x, n, 1.0 - confidence);
      return qelOk;
  }
  return badType(&r->lowerLimit, &r->upperLimit);
}

// Newcombe's corrected score limits, z the multiplier and z2 the square of
// the two-sided quantile.
double correctedLower(double x, double n, double z, double z2) {
  const double a = x - 0.5;
  const double d = n + z2;
  return (a + 0.5 * z2) / d - z * RootOrNaN(((n - x + 0.5) / n) * a + 0.25 * z2) / d;
}

double correctedUpper(double x, double n, double z, double z2) {
  const double b = x + 0.5;
  const double d = n + z2;
  return (b + 0.5 * z2) / d + z * RootOrNaN(((n - x - 0.5) / n) * b + 0.25 * z2) / d;
}

int wilsonLimits(OneProportion* r, bool correction, double confidence, IntervalType type) {
  const double x = r->events, n = r->trials;
  const double z = TwoSidedZ(confidence);
  const double z2 = z * z;
  if (!correction) {
    const double d = n + z2;
    const double centre = (x + 0.5 * z2) / d;
    const double scale = RootOrNaN((1.0 - x / n) * x + 0.25 * z2) / d;
    return NormalInterval(confidence, type, centre, scale, &r->lowerLimit, &r->upperLimit);
  }
  if (badConfidence(confidence)) return badType(&r->lowerLimit, &r->upperLimit);
  const double infinity = std::numeric_limits<double>::infinity();
  switch (type) {
    case kIntervalTwoSided:
      r->lowerLimit = correctedLower(x, n, z, z2);
      r->upperLimit = correctedUpper(x, n, z, z2);
      return qelOk;
    case kIntervalLowerBound:
      r->lowerLimit = correctedLower(x, n, NormalInvCdf(confidence, 0.0, 1.0), z2);
      r->upperLimit = infinity;
      return qelOk;
    case kIntervalUpperBound:
      r->lowerLimit = -infinity;
      r->upperLimit = correctedUpper(x, n, NormalInvCdf(confidence, 0.0, 1.0), z2);
      return qelOk;
  }
  return badType(&r->lowerLimit, &r->upperLimit);
}

void zTest(OneProportion* r, double p0) {
  r->statistic = zStatistic(r->events, r->trials, p0, 0.0);
}

// The rule of the application: the Wald interval, or the exact interval
// turned one-sided when x = 0 (checked first) or x = n.
int lynInterval(OneProportion* r, bool useNormal, double confidence, IntervalType type) {
  const double x = r->events, n = r->trials;
  r->proportion = GetSampleProportion(r->events, r->trials);
  if (useNormal) {
    return NormalInterval(confidence, type, r->proportion, waldError(r->proportion, n),
                          &r->lowerLimit, &r->upperLimit);
  }
  if (type != kIntervalTwoSided && type != kIntervalLowerBound && type != kIntervalUpperBound)
    return badType(&r->lowerLimit, &r->upperLimit);
  if (r->events == 0) {
    type = kIntervalUpperBound;
  } else if (r->events == r->trials) {
    type = kIntervalLowerBound;
  }
  return exactLimits(x, n, confidence, type, &r->lowerLimit, &r->upperLimit);
}

int lynTest(OneProportion* r, bool useNormal, AlternativeHypothesis alternative, double p0) {
  if (useNormal) {
    zTest(r, p0);
    r->pValue = ZPValue(r->statistic, alternative);
    return qelOk;
  }
  // The binomial P-value names no tail for an unknown alternative.
  if (!isKnown(alternative)) return qelFailBadEnumValue;
  r->pValue = BinomialPValue(r->events, r->trials, p0, alternative);
  return qelOk;
}

int lynBoth(OneProportion* r, bool useNormal, double confidence, IntervalType type,
            AlternativeHypothesis alternative, double p0) {
  const int code = lynInterval(r, useNormal, confidence, type);
  if (code != qelOk) return code;
  return lynTest(r, useNormal, alternative, p0);
}

int plainInterval(OneProportion* r, bool useScore, double confidence, IntervalType type) {
  if (useScore) return wilsonLimits(r, false, confidence, type);
  return exactLimits(r->events, r->trials, confidence, type, &r->lowerLimit, &r->upperLimit);
}

int plainBoth(OneProportion* r, bool useScore, double confidence, IntervalType type,
              AlternativeHypothesis alternative, double p0) {
  const int code = plainInterval(r, useScore, confidence, type);
  if (code != qelOk) return code;
  if (!useScore) return exactTest(r, alternative, p0);
  zTest(r, p0);
  r->pValue = ZPValue(r->statistic, alternative);
  return qelOk;
}

void countEvents(OneProportion* r, int const* events) {
  r->events = v1::GetEventCount(events, r->trials);
}

}  // namespace

OneProportion::OneProportion()
    : proportion(kNaN),
      lowerLimit(kNaN),
      upperLimit(kNaN),
      statistic(kNaN),
      pValue(kNaN),
      events(0),
      trials(0) {}

double GetSampleProportion(unsigned int events, unsigned int trials) {
  return static_cast<double>(events) / static_cast<double>(trials);
}

int RunLynOneProportion(OneProportion* record, int const* events, bool useNormal, double confidence,
                        IntervalType type) {
  countEvents(record, events);
  return lynInterval(record, useNormal, confidence, type);
}

int RunLynOneProportion(OneProportion* record, int const* events, bool useNormal, double confidence,
                        IntervalType type, AlternativeHypothesis alternative, double p0) {
  countEvents(record, events);
  return lynBoth(record, useNormal, confidence, type, alternative, p0);
}

int RunLynOneProportion(OneProportion* record, bool useNormal, double confidence,
                        IntervalType type) {
  return lynInterval(record, useNormal, confidence, type);
}

int RunLynOneProportion(OneProportion* record, bool useNormal, AlternativeHypothesis alternative,
                        double p0) {
  return lynTest(record, useNormal, alternative, p0);
}

int RunLynOneProportion(OneProportion* record, bool useNormal, double confidence, IntervalType type,
                        AlternativeHypothesis alternative, double p0) {
  return lynBoth(record, useNormal, confidence, type, alternative, p0);
}

int RunOneProportion(OneProportion* record, int const* events, bool useScore, double confidence,
                     IntervalType type) {
  countEvents(record, events);
  record->proportion = GetSampleProportion(record->events, record->trials);
  return plainInterval(record, useScore, confidence, type);
}

int RunOneProportion(OneProportion* record, int const* events, bool useScore, double confidence,
                     IntervalType type, AlternativeHypothesis alternative, double p0) {
  countEvents(record, events);
  record->proportion = GetSampleProportion(record->events, record->trials);
  return plainBoth(record, useScore, confidence, type, alternative, p0);
}

int RunOneProportion(OneProportion* record, bool useScore, double confidence, IntervalType type) {
  return plainInterval(record, useScore, confidence, type);
}

int RunOneProportion(OneProportion* record, bool useScore, double confidence, IntervalType type,
                     AlternativeHypothesis alternative, double p0) {
  return plainBoth(record, useScore, confidence, type, alternative, p0);
}

int RunOneProportionWilson(OneProportion* record, bool continuityCorrection, double confidence,
                           IntervalType type) {
  return wilsonLimits(record, continuityCorrection, confidence, type);
}

int RunOneProportionWilson(OneProportion* record, bool continuityCorrection,
                           AlternativeHypothesis alternative, double p0) {
  const double x = record->events, n = record->trials;
  double c = 0.0;
  if (continuityCorrection) {
    if (alternative == kAlternativeLess) {
      c = 0.5;
    } else if (alternative == kAlternativeGreater) {
      c = -0.5;
    } else if (alternative == kAlternativeNotEqual && std::fabs(x - n * p0) >= 0.5 * n) {
      c = -0.5;
    }
  }
  record->statistic = zStatistic(x, n, p0, c);
  record->pValue = ZPValue(record->statistic, alternative);
  return qelOk;
}

int RunOneProportionClopperPearson(OneProportion* record, double confidence, IntervalType type) {
  return exactLimits(record->events, record->trials, confidence, type, &record->lowerLimit,
                     &record->upperLimit);
}

int RunOneProportionClopperPearson(OneProportion* record, AlternativeHypothesis alternative,
                                   double p0) {
  return exactTest(record, alternative, p0);
}

int RunOneProportionWaldCI(OneProportion* record, bool continuityCorrection, double confidence,
                           IntervalType type) {
  const double n = record->trials;
  const double p = GetSampleProportion(record->events, record->trials);
  const int code = NormalInterval(confidence, type, p, waldError(p, n), &record->lowerLimit,
                                  &record->upperLimit);
  if (code == qelOk && continuityCorrection) {
    record->lowerLimit -= 0.5 / n;
    record->upperLimit += 0.5 / n;
  }
  return code;
}

int RunOneProportionAgrestiCoullCI(OneProportion* record, bool addTwoFour, double confidence,
                                   IntervalType type) {
  double x = record->events, n = record->trials;
  if (addTwoFour) {
    x += 2.0;
    n += 4.0;
  } else {
    const double z = TwoSidedZ(confidence);
    x += 0.5 * z * z;
    n += z * z;
  }
  const double p = x / n;
  return NormalInterval(confidence, type, p, waldError(p, n), &record->lowerLimit,
                        &record->upperLimit);
}

int RunOneProportionMidP(OneProportion* record, double confidence, IntervalType type) {
  return midPLimits(record, confidence, type);
}

int RunOneProportionMidP(OneProportion* record, AlternativeHypothesis alternative, double p0) {
  if (!isKnown(alternative)) return qelFailBadEnumValue;
  const unsigned int x = record->events, n = record->trials;
  const double f = v1::BinomialPdf(x, n, p0);
  double lower, upper;
  tails(x, n, p0, &lower, &upper);
  if (alternative == kAlternativeLess) {
    record->pValue = lower - 0.5 * f;
  } else if (alternative == kAlternativeGreater) {
    record->pValue = upper - 0.5 * f;
  } else {
    record->pValue = std::min(1.0, 2.0 * std::min(lower, upper)) - f;
  }
  return qelOk;
}

double GetLowerMidPBound(unsigned int events, unsigned int trials, double alpha) {
  return midPBound(true, events, trials, alpha);
}

double GetUpperMidPBound(unsigned int events, unsigned int trials, double alpha) {
  return midPBound(false, events, trials, alpha);
}

}  // namespace v0
}  // namespace qel
