// Ratio of two standard deviations: chi-square limits of each deviation,
// the F interval and test, Bonett's (2006) robust interval and test, and a
// Levene-type test (Levene, 1960, with Brown and Forsythe's, 1974, medians)
// with Fieller's (1954) interval for the ratio of the mean absolute
// deviations.
#include <omp.h>
#include <qel/descriptive.h>
#include <qel/distributions.h>
#include <qel/variance_tests.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <new>
#include <vector>

#include "basic_statistics/VarianceComparisonUtil.h"
#include "interfaces/basic_statistics/proportions.h"
#include "interfaces/basic_statistics/utilities_variance.h"
#include "interfaces/math/random_distributions_v0.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {
namespace v0 {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();
const double kInfinity = std::numeric_limits<double>::infinity();

bool positiveFinite(double x) {
  return x > 0.0 && x < kInfinity;
}

double upperTail(double z) {
  if (std::isinf(z)) return z > 0.0 ? 0.0 : 1.0;
  return NormalCdf(z, 0.0, 1.0, true);
}

// One side of Bonett's test for unequal sizes: the upper tail at the z where
// the lower limit of the variance ratio meets q. When q lies below every
// lower limit the tail at the smallest limit bounds it; when the limit
// cannot be formed the side counts 1.
double bonettSide(double n1, double n2, double r, double q, double se) {
  const double z = SolvePValueEquation(n1, n2, r, q, se);
  if (!std::isnan(z)) return upperTail(z);
  const double top = mPValueEquationBranchTop(n1, n2, se);
  if (n1 < n2 && CmTwoSamplePValueFunction(n1, n2, se, r, q)(top) > 0.0) return upperTail(top);
  return 1.0;
}

void bonettTest(TwoVariance* r, BonettCIForStdDevRatio const& first,
                BonettCIForStdDevRatio const& second, AlternativeHypothesis alternative,
                double ratio0) {
  const double q = ratio0 * ratio0;
  const double ratio = r->firstVariance / r->secondVariance;
  const double v = mBonettLogRatioVariance(first, second, q);
  const double se = v >= 0.0 ? std::sqrt(v) : kNaN;
  if (!(positiveFinite(ratio) && positiveFinite(q) && positiveFinite(se))) return;
  const double n1 = r->firstN, n2 = r->secondN;
  if (r->firstN == r->secondN) {
    const double z = (std::log(ratio) - std::log(q)) / se;
    r->bonettStatistic = z * z;
    r->bonettPValue = ZPValue(z, alternative);
    return;
  }
  r->bonettStatistic = kNaN;
  const double greater = alternative != kAlternativeLess ? bonettSide(n1, n2, ratio, q, se) : 1.0;
  const double less =
      alternative != kAlternativeGreater ? bonettSide(n2, n1, 1.0 / ratio, 1.0 / q, se) : 1.0;
  const double p = std::min(greater, less);
  r->bonettPValue = alternative == kAlternativeNotEqual ? std::min(1.0, 2.0 * p) : p;
}

EConfidenceType confidenceTypeOf(IntervalType type) {
  if (type == kIntervalLowerBound) return kConfidenceLowerSide;
  if (type == kIntervalUpperBound) return kConfidenceUpperSide;
  return kConfidenceTwoSided;
}

// Median by the type 6 quantile at 0.5, then the absolute deviations from
// it in place. The median's order statistics come from a selection
// (std::nth_element) rather than a sort: the deviations are summed in any
// order.
void absDeviations(double* x, unsigned int n) {
  if (n == 0) return;
  const double h = 0.5 * (static_cast<double>(n) + 1.0);
  const unsigned int j = static_cast<unsigned int>(h);  // 1-based
  const double fraction = h - j;
  std::nth_element(x, x + (j - 1), x + n);
  double median = x[j - 1];
  if (fraction != 0.0) median += fraction * (*std::min_element(x + j, x + n) - x[j - 1]);
  for (unsigned int i = 0; i < n; ++i) x[i] = std::fabs(x[i] - median);
}

// The Fieller limit on one side, or NaN when the denominator mean is not
// clear of zero or the limit falls on the wrong side of the deviation ratio.
double fiellerLimit(bool upper, double m1, double m2, double v1, double v2, double q,
                    double sdRatio) {
  const double d = m2 * m2 - v2 * q * q;
  const double root = RootOrNaN(m2 * m2 * v1 + m1 * m1 * v2 - v1 * q * q * v2);
  if (upper) {
    if (!(m2 / RootOrNaN(v2) > q)) return kNaN;
    const double limit = (m1 * m2 + q * root) / d;
    return limit >= sdRatio ? limit : kNaN;
  }
  if (!(m1 / RootOrNaN(v1) > q)) return kNaN;
  const double limit = (m1 * m2 - q * root) / d;
  return limit <= sdRatio ? limit : kNaN;
}

int leveneMethod(TwoVariance* r, double const* x, double const* y, double confidence,
                 IntervalType type, AlternativeHypothesis alternative, double ratio0) {
  try {
    std::vector<double> dx(x, x + r->firstN), dy(y, y + r->secondN);
    CalcAbsMedianDeviations(dx.data(), r->firstN, dy.data(), r->secondN);
    return PerformLeveneMethod(r, dx.data(), dy.data(), confidence, type, alternative, ratio0);
  } catch (const std::bad_alloc&) {
    return qelFailOutOfMemory;
  }
}

int summaryForm(TwoVariance* r, double confidence, IntervalType type,
                AlternativeHypothesis alternative, double ratio0) {
  double limits[4];
  const double df1 = static_cast<double>(r->firstN) - 1.0;
  const double df2 = static_cast<double>(r->secondN) - 1.0;
  int code =
      PerformChiSquareMethod(&limits[0], &limits[1], r->firstVariance, df1, confidence, type);
  PerformChiSquareMethod(&limits[2], &limits[3], r->secondVariance, df2, confidence, type);
  r->firstStdDevLowerLimit = RootOrNaN(limits[0]);
  r->firstStdDevUpperLimit = RootOrNaN(limits[1]);
  r->secondStdDevLowerLimit = RootOrNaN(limits[2]);
  r->secondStdDevUpperLimit = RootOrNaN(limits[3]);
  if (code == qelOk) code = PerformFMethod(r, confidence, type, alternative, ratio0);
  return code;
}

}  // namespace

TwoVariance::TwoVariance()
    : firstVariance(kNaN),
      secondVariance(kNaN),
      firstStdDevLowerLimit(kNaN),
      firstStdDevUpperLimit(kNaN),
      secondStdDevLowerLimit(kNaN),
      secondStdDevUpperLimit(kNaN),
      bonettLowerLimit(kNaN),
      bonettUpperLimit(kNaN),
      leveneLowerLimit(kNaN),
      leveneUpperLimit(kNaN),
      fLowerLimit(kNaN),
      fUpperLimit(kNaN),
      bonettStatistic(kNaN),
      bonettPValue(kNaN),
      leveneStatistic(kNaN),
      levenePValue(kNaN),
      leveneDegreesOfFreedom(kNaN),
      fStatistic(kNaN),
      fPValue(kNaN),
      fNumeratorDegreesOfFreedom(kNaN),
      fDenominatorDegreesOfFreedom(kNaN),
      firstN(0),
      secondN(0) {}

double SolvePValueEquation(double n1, double n2, double ratio, double ratio0,
                           double standardError) {
  const double z = mSolvePValueEquation(n1, n2, ratio, ratio0, standardError);
  return mIsNumericMissing(z) ? kNaN : z;
}

int PerformFMethod(TwoVariance* r, double confidence, IntervalType type,
                   AlternativeHypothesis alternative, double ratio0) {
  const double df1 = static_cast<double>(r->firstN) - 1.0;
  const double df2 = static_cast<double>(r->secondN) - 1.0;
  r->fNumeratorDegreesOfFreedom = df1;
  r->fDenominatorDegreesOfFreedom = df2;
  const double ratio = r->firstVariance / r->secondVariance;
  // The quantile of F(df2, df1) scales the variance ratio into its limit.
  auto limit = [&](double p) { return RootOrNaN(ratio * FQuantile(p, df2, df1)); };
  switch (type) {
    case kIntervalTwoSided:
      r->fLowerLimit = limit((1.0 - confidence) * 0.5);
      r->fUpperLimit = limit((1.0 + confidence) * 0.5);
      break;
    case kIntervalLowerBound:
      r->fLowerLimit = limit(1.0 - confidence);
      r->fUpperLimit = kInfinity;
      break;
    case kIntervalUpperBound:
      r->fLowerLimit = 0.0;
      r->fUpperLimit = limit(confidence);
      break;
    default:
      r->fLowerLimit = kNaN;
      r->fUpperLimit = kNaN;
      return qelFailBadEnumValue;
  }
  if (!IsKnownAlternative(alternative)) return qelFailBadEnumValue;
  const double f = r->firstVariance / (ratio0 * ratio0 * r->secondVariance);
  r->fStatistic = f;
  if (std::isnan(f)) {
    r->fPValue = 1.0;
  } else if (std::isinf(f)) {
    // An infinite ratio: certain against "greater", no evidence for "less".
    r->fPValue = alternative == kAlternativeLess ? 1.0 : 0.0;
  } else {
    r->fPValue = FTailPValue(f, df1, df2, alternative);
  }
  return qelOk;
}

int PerformBonettMethodForEach(TwoVariance* r, double const* x, double const* y, double confidence,
                               IntervalType type, double* firstKurtosis, double* secondKurtosis) {
  double lower, upper;
  *firstKurtosis = r->firstVariance;
  *secondKurtosis = r->secondVariance;
  const int first =
      PerformBonettMethod(&lower, &upper, firstKurtosis, confidence, x, r->firstN, type);
  const int second =
      PerformBonettMethod(&lower, &upper, secondKurtosis, confidence, y, r->secondN, type);
  return std::max(first, second);
}

int PerformBonettMethod(TwoVariance* r, double const* x, double const* y, double confidence,
                        IntervalType type, AlternativeHypothesis alternative, double ratio0) {
  double k1, k2;
  const int eachCode = PerformBonettMethodForEach(r, x, y, confidence, type, &k1, &k2);
  if (eachCode == qelFailOutOfMemory || eachCode == qelFailBadEnumValue) return eachCode;
  BonettCIForStdDevRatio first{k1, r->firstVariance, static_cast<double>(r->firstN)};
  BonettCIForStdDevRatio second{k2, r->secondVariance, static_cast<double>(r->secondN)};
  double lower, upper;
  const bool found =
      mCalcCIForRatios(&lower, &upper, first, second, 1.0 - confidence, confidenceTypeOf(type));
  r->bonettLowerLimit =
      mIsNumericMissing(lower) ? (type == kIntervalUpperBound ? 0.0 : kNaN) : lower;
  r->bonettUpperLimit =
      mIsNumericMissing(upper) ? (type == kIntervalLowerBound ? kInfinity : kNaN) : upper;
  bonettTest(r, first, second, alternative, ratio0);
  return std::max(eachCode, found ? qelOk : qelFailNoConvergence);
}

void CalcAbsMedianDeviations(double* x, unsigned int n1, double* y, unsigned int n2) {
#pragma omp parallel sections if (!omp_in_parallel())
  {
#pragma omp section
    absDeviations(x, n1);
#pragma omp section
    absDeviations(y, n2);
  }
}

int PerformLeveneMethod(TwoVariance* r, double const* dx, double const* dy, double confidence,
                        IntervalType type, AlternativeHypothesis alternative, double ratio0) {
  const unsigned int n1 = r->firstN, n2 = r->secondN;
  double m1 = kNaN, v1 = kNaN, m2 = kNaN, v2 = kNaN;
#pragma omp parallel sections if (!omp_in_parallel())
  {
#pragma omp section
    v1::GetSampleMeanAndVariance(dx, n1, &m1, &v1);
#pragma omp section
    v1::GetSampleMeanAndVariance(dy, n2, &m2, &v2);
  }
  const double nd1 = n1, nd2 = n2;
  const double s = 1.0 / nd1 + 1.0 / nd2;
  const double df = nd1 + nd2 - 2.0;
  r->leveneDegreesOfFreedom = df;
  if (!IsKnownIntervalType(type)) {
    r->leveneLowerLimit = kNaN;
    r->leveneUpperLimit = kNaN;
    return qelFailBadEnumValue;
  }
  const double var1 = v1 * s * (nd1 - 1.0) / df;
  const double var2 = v2 * s * (nd2 - 1.0) / df;
  const double q =
      v0::TInvCdf(type == kIntervalTwoSided ? (confidence + 1.0) * 0.5 : confidence, df, 0.0);
  const double sdRatio = RootOrNaN(r->firstVariance / r->secondVariance);
  r->leveneLowerLimit =
      type == kIntervalUpperBound ? 0.0 : fiellerLimit(false, m1, m2, var1, var2, q, sdRatio);
  r->leveneUpperLimit =
      type == kIntervalLowerBound ? kInfinity : fiellerLimit(true, m1, m2, var1, var2, q, sdRatio);
  if (!IsKnownAlternative(alternative)) return qelFailBadEnumValue;
  const double t = (m1 - ratio0 * m2) /
                   RootOrNaN(((nd1 - 1.0) * v1 + (nd2 - 1.0) * v2 * ratio0 * ratio0) / df * s);
  r->leveneStatistic = t * t;
  r->levenePValue = v0::TPValue(t, df, alternative);
  return qelOk;
}

int RunTwoVariance(TwoVariance* record, double const* x, double const* y, double confidence,
                   IntervalType type, AlternativeHypothesis alternative, double ratio0,
                   bool useLevene) {
  record->firstVariance = v1::GetSampleVariance(x, record->firstN);
  record->secondVariance = v1::GetSampleVariance(y, record->secondN);
  const int code = summaryForm(record, confidence, type, alternative, ratio0);
  if (code != qelOk) return code;
  if (useLevene) return leveneMethod(record, x, y, confidence, type, alternative, ratio0);
  return PerformBonettMethod(record, x, y, confidence, type, alternative, ratio0);
}

int RunTwoVariance(TwoVariance* record, double confidence, IntervalType type,
                   AlternativeHypothesis alternative, double ratio0) {
  return summaryForm(record, confidence, type, alternative, ratio0);
}

}  // namespace v0
}  // namespace qel
