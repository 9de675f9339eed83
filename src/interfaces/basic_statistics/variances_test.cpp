// Equality of k variances. Under normality: chi-square limits with a
// Bonferroni split of the error, the F test for two samples and Bartlett's
// (1937) test, in Box's (1949) F form for 130 samples or more. In general:
// Bonett's (2006) limits of each variance, a multiple comparison test of
// the pairwise log variance ratios with the scale split of Hochberg and
// Tamhane (1987, Multiple Comparison Procedures, section 3.3) and the
// normal range law, and Levene's (1960) test with the medians of Brown and
// Forsythe (1974).
#include "interfaces/basic_statistics/variances_test.h"

#include <omp.h>
#include <qel/basic_types.h>
#include <qel/descriptive.h>
#include <qel/distributions.h>
#include <qel/variance_tests.h>

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <limits>
#include <new>
#include <vector>

#include "basic_statistics/VarianceComparisonUtil.h"
#include "interfaces/basic_statistics/utilities_variance.h"
#include "interfaces/linear_modelling/levene_method.h"
#include "interfaces/linear_modelling/utilities.h"
#include "interfaces/math/random_distributions_v0.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/normal_range.h"

namespace qel {
namespace v0 {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();
const double kInfinity = std::numeric_limits<double>::infinity();
const double kSqrt2 = 1.4142135623730951;
// From this many samples Bartlett's chi-square approximation gives way to
// Box's F form.
constexpr unsigned kBoxFromSamples = 130;

bool positiveFinite(double x) {
  return x > 0.0 && x < kInfinity;
}

// +inf gives 0 and NaN 1; otherwise the upper tail.
double upperTailOrBound(double statistic, double p) {
  if (std::isnan(statistic)) return 1.0;
  if (statistic == kInfinity) return 0.0;
  return p;
}

double safeLog(double x) {
  return x > 0.0 ? std::log(x) : (x == 0.0 ? -kInfinity : kNaN);
}

void computeVariances(VariancesTest* test) {
  VariancesTestSample* s = test->samples;
  const long k = test->k;
#pragma omp parallel for schedule(static)
  for (long i = 0; i < k; ++i) s[i].variance = v1::GetSampleVariance(s[i].data, s[i].n);
}

// Missing values of the inner kernels become NaN.
double orNaN(double x) {
  return mIsNumericMissing(x) ? kNaN : x;
}

// The normal range quantile of the confidence, over sqrt(2): the z of the
// comparison limits. NaN when it cannot be found.
double rangeQuantile(double confidence, unsigned k) {
  try {
    return orNaN(mNormalRangeInvCdf(confidence, static_cast<int>(k))) / kSqrt2;
  } catch (...) {
    return kNaN;
  }
}

double rangeUpperTail(double z, unsigned k) {
  if (std::isnan(z)) return 1.0;
  if (std::isinf(z)) return z > 0.0 ? 0.0 : 1.0;
  try {
    const double p = orNaN(mNormalRangeCdf(z, static_cast<int>(k), true));
    return std::isnan(p) ? 1.0 : p;
  } catch (...) {
    return 1.0;
  }
}

// The quantile at which Bonett's lower limit of the variance ratio r of
// sizes n1, n2 meets 1. When 1 lies below every lower limit (possible for
// n1 < n2) there is no root; the top of the falling branch then bounds the
// quantile from below, as in the two-sample test, rather than leaving the
// pair without evidence.
double lowerLimitQuantile(double n1, double n2, double r, double se) {
  const double z = orNaN(SolvePValueEquation(n1, n2, r, 1.0, se));
  if (!std::isnan(z) || !(n1 < n2) || !positiveFinite(se)) return z;
  const double top = mPValueEquationBranchTop(n1, n2, se);
  return CmTwoSamplePValueFunction(n1, n2, se, r, 1.0)(top) > 0.0 ? top : kNaN;
}

// Multiple comparison limits of each variance, n > z required.
void comparisonLimits(VariancesTest* test, double z) {
  VariancesTestSample* s = test->samples;
  const long k = test->k;
#pragma omp parallel for schedule(static)
  for (long i = 0; i < k; ++i) {
    const double n = s[i].n, v = s[i].variance, V = s[i].fourthWorkValue;
    if (!(n > z) || std::isnan(z) || std::isnan(V)) {
      s[i].thirdWorkValue = kNaN;
      s[i].fourthWorkValue = kNaN;
      continue;
    }
    const double f = n / (n - z);
    const double e = std::exp(std::min(z * V, 709.0));
    s[i].thirdWorkValue = f * v / e;
    s[i].fourthWorkValue = f * v * e;
  }
}

// The pooled-kurtosis part of Bonett's variance of ln(v_i/v_j), divided by
// n_i + n_j: (r^2 a^2 k_i/n_i + k_j/n_j)/(r a + 1)^2, r = v_i/v_j, a =
// (n_i-1)/(n_j-1). Written in v_i, v_j so that neither ratio overflows.
double pooledKurtosisTerm(VariancesTestSample const& a, VariancesTestSample const& b) {
  const double ni = a.n, nj = b.n;
  const double wi = (ni - 1.0) * a.variance, wj = (nj - 1.0) * b.variance;
  const double scale = std::max(wi, wj);
  const double xi = wi / scale, xj = wj / scale;
  return (xi * xi * a.thirdWorkValue / ni + xj * xj * b.thirdWorkValue / nj) /
         ((xi + xj) * (xi + xj));
}

double pairStandardError(VariancesTestSample const& a, VariancesTestSample const& b) {
  const double ni = a.n, nj = b.n;
  const bool pi = a.variance > 0.0, pj = b.variance > 0.0;
  if (pi && pj) {
    const double g =
        (ni + nj) * (ni - 1.0 + nj - 1.0) / ((ni - 1.0) * (nj - 1.0)) * pooledKurtosisTerm(a, b);
    const double d = g - ((ni - 3.0) / ni / (ni - 1.0) + (nj - 3.0) / nj / (nj - 1.0));
    return d >= 0.0 ? std::sqrt(d) : kNaN;
  }
  if (pi) return 1.0 + ni / nj;
  if (pj) return nj / ni + 1.0;
  const double t = (ni + nj - 1.0) / (ni + nj - 2.0);
  return t * t;
}

// The type 6 quantile at 0.5 (the median) of x[0..n-1], which is
// reordered: two selections (Hoare's FIND, as std::nth_element) in O(n)
// where a sort takes n log n. NaN for n = 0 or when a value is NaN.
double medianInPlace(double* x, unsigned n) {
  if (n == 0 || std::any_of(x, x + n, [](double v) { return std::isnan(v); })) return kNaN;
  const unsigned mid = n / 2;
  std::nth_element(x, x + mid, x + n);
  const double upper = x[mid];
  if (n % 2 == 1) return upper;
  const double lower = *std::max_element(x, x + mid);
  return lower + (upper - lower) * 0.5;
}

}  // namespace

VariancesTestSample::VariancesTestSample()
    : variance(kNaN),
      lowerLimit(kNaN),
      upperLimit(kNaN),
      thirdWorkValue(kNaN),
      fourthWorkValue(kNaN),
      data(nullptr),
      n(0) {}

VariancesTest::VariancesTest()
    : leveneStatistic(kNaN),
      levenePValue(kNaN),
      mainStatistic(kNaN),
      mainPValue(kNaN),
      individualConfidence(kNaN),
      samples(nullptr),
      k(0) {}

void PerformBarlettMethod(VariancesTest* test) {
  VariancesTestSample const* s = test->samples;
  const long k = test->k;
  double dfSum = 0.0, pooledSum = 0.0, logSum = 0.0, reciprocalSum = 0.0;
#pragma omp parallel for schedule(static) reduction(+ : dfSum, pooledSum, logSum, reciprocalSum)
  for (long i = 0; i < k; ++i) {
    const double df = static_cast<double>(s[i].n) - 1.0;
    dfSum += df;
    pooledSum += df * s[i].variance;
    logSum += df * safeLog(s[i].variance);
    reciprocalSum += 1.0 / df;
  }
  const double pooled = pooledSum / dfSum;
  const double M = dfSum * safeLog(pooled) - logSum;
  const double c = (reciprocalSum - 1.0 / dfSum) / (3.0 * (k - 1.0));
  test->mainStatistic = M;
  double statistic = kNaN, p = kNaN;
  if (test->k < kBoxFromSamples) {
    statistic = M / (1.0 + c);
    if (std::isfinite(statistic)) p = ChiSqPValue(statistic, k - 1.0, kAlternativeGreater);
  } else {
    const double a = (k + 1.0) / (c * c);
    const double b = a / (1.0 - c + 2.0 / a);
    statistic = a * M / ((k - 1.0) * (b - M));
    if (std::isfinite(statistic) && positiveFinite(a))
      p = FPValue(statistic, k - 1.0, a, kAlternativeGreater);
  }
  test->mainStatistic = statistic;
  test->mainPValue = upperTailOrBound(statistic, p);
}

int RunVariancesTestNormal(VariancesTest* test) {
  test->leveneStatistic = kNaN;
  test->levenePValue = kNaN;
  VariancesTestSample* s = test->samples;
  int code = qelOk;
  for (unsigned i = 0; i < test->k; ++i) {
    const int c = PerformChiSquareMethod(&s[i].lowerLimit, &s[i].upperLimit, s[i].variance,
                                         static_cast<double>(s[i].n) - 1.0,
                                         test->individualConfidence, kIntervalTwoSided);
    code = std::max(code, c);
    s[i].thirdWorkValue = kNaN;
    s[i].fourthWorkValue = kNaN;
  }
  if (test->k == 2) {
    const double f = s[0].variance / s[1].variance;
    const double df1 = s[0].n - 1.0, df2 = s[1].n - 1.0;
    test->mainStatistic = f;
    const double p = std::isfinite(f) && df1 > 0.0 && df2 > 0.0
                         ? FPValue(f, df1, df2, kAlternativeGreater)
                         : kNaN;
    test->mainPValue = upperTailOrBound(f, p);
  } else if (test->k > 2) {
    PerformBarlettMethod(test);
  }
  return code;
}

void CalcVMulSample(VariancesTest* test) {
  VariancesTestSample* s = test->samples;
  const long k = test->k;
  std::vector<double> rowSums(k, 0.0);
  double total = 0.0;
#pragma omp parallel for schedule(static) reduction(+ : total)
  for (long i = 0; i < k; ++i) {
    double row = 0.0;
    for (long j = 0; j < k; ++j) {
      if (j == i) continue;
      const double c = pairStandardError(s[i], s[j]);
      row += c;
      if (j > i) total += c;
    }
    rowSums[i] = row;
  }
  const double km1 = k - 1.0;
#pragma omp parallel for schedule(static)
  for (long i = 0; i < k; ++i)
    s[i].fourthWorkValue = (rowSums[i] * km1 - total) / (km1 * (k - 2.0));
}

void CalcVTwoSample(VariancesTest* test) {
  VariancesTestSample* s = test->samples;
  const double n1 = s[0].n, n2 = s[1].n, N = n1 + n2;
  const bool p1 = s[0].variance > 0.0, p2 = s[1].variance > 0.0;
  double g;
  if (p1 && p2) {
    g = pooledKurtosisTerm(s[0], s[1]);
  } else if (p1) {
    g = 1.0 / n2;
  } else if (p2) {
    g = 1.0 / n1;
  } else {
    const double t = (N - 1.0) / (N - 2.0);
    g = t * t / N;
  }
  const double u1 = N / (n1 - 1.0) * g - (n1 - 3.0) / n1 / (n1 - 1.0);
  const double u2 = N / (n2 - 1.0) * g - (n2 - 3.0) / n2 / (n2 - 1.0);
  const double r1 = u1 >= 0.0 ? std::sqrt(u1) : kNaN, r2 = u2 >= 0.0 ? std::sqrt(u2) : kNaN;
  const double se = std::sqrt(u1 + u2);
  s[0].fourthWorkValue = r1 / (r1 + r2) * se;
  s[1].fourthWorkValue = se * r2 / (r1 + r2);
}

void CalcPForMulSample(VariancesTest* test) {
  VariancesTestSample const* s = test->samples;
  const unsigned k = test->k;
  double P = 1.0;
  for (unsigned i = 0; i < k; ++i) {
    for (unsigned j = i + 1; j < k; ++j) {
      const double se = s[i].fourthWorkValue + s[j].fourthWorkValue;
      const double r = s[i].variance / s[j].variance;
      double p1 = 1.0, p2 = 1.0;
      if (r > 0.0 && r < kInfinity) {
        if (s[i].n == s[j].n) {
          const double z = kSqrt2 * std::fabs(std::log(r)) / se;
          p1 = p2 = rangeUpperTail(z, k);
        } else {
          const double z1 = lowerLimitQuantile(s[i].n, s[j].n, r, se) * kSqrt2;
          const double z2 = lowerLimitQuantile(s[j].n, s[i].n, 1.0 / r, se) * kSqrt2;
          p1 = rangeUpperTail(z1, k);
          p2 = rangeUpperTail(z2, k);
        }
      } else if (r > 0.0 || std::isfinite(r)) {
        p1 = 0.0;
      }
      P = std::min(P, std::min(p1, p2));
    }
  }
  test->mainStatistic = kNaN;
  test->mainPValue = P;
}

double PerformMCTwoSample(VariancesTest* test, double confidence) {
  VariancesTestSample const* s = test->samples;
  TwoVariance two;
  two.firstN = s[0].n;
  two.secondN = s[1].n;
  two.firstVariance = s[0].variance;
  two.secondVariance = s[1].variance;
  const double se = s[0].fourthWorkValue + s[1].fourthWorkValue;
  const double r = s[0].variance / s[1].variance;
  double p = kNaN;
  if (positiveFinite(r) && positiveFinite(se)) {
    if (s[0].n == s[1].n) {
      p = std::min(1.0, 2.0 * NormalCdf(std::fabs(std::log(r)) / se, 0.0, 1.0, true));
    } else {
      auto side = [&](double n1, double n2, double ratio) {
        const double z = lowerLimitQuantile(n1, n2, ratio, se);
        if (std::isnan(z)) return 1.0;
        return std::isinf(z) ? (z > 0.0 ? 0.0 : 1.0) : NormalCdf(z, 0.0, 1.0, true);
      };
      p = std::min(1.0, 2.0 * std::min(side(s[0].n, s[1].n, r), side(s[1].n, s[0].n, 1.0 / r)));
    }
  } else if (r > 0.0 || std::isfinite(r)) {
    p = 0.0;
  }
  test->mainStatistic = kNaN;
  test->mainPValue = p;
  return NormalInvCdf((1.0 + confidence) * 0.5, 0.0, 1.0);
}

int PerformMultipleLevene(VariancesTest* test) {
  VariancesTestSample const* s = test->samples;
  const unsigned k = test->k;
  try {
    std::vector<unsigned> sizes(k);
    std::vector<std::size_t> offsets(k + 1, 0);
    for (unsigned i = 0; i < k; ++i) {
      sizes[i] = s[i].n;
      offsets[i + 1] = offsets[i] + s[i].n;
    }
    const std::size_t N = offsets[k];
    if (N > std::numeric_limits<unsigned>::max()) return qelFailOutOfMemory;
    std::vector<double> y(N);
    const long kk = k;
#pragma omp parallel for schedule(static)
    for (long i = 0; i < kk; ++i) {
      double* part = y.data() + offsets[i];
      std::copy(s[i].data, s[i].data + s[i].n, part);
      const double median = medianInPlace(part, s[i].n);
      for (unsigned m = 0; m < s[i].n; ++m) part[m] = std::fabs(part[m] - median);
    }
    int status = qelOk;
    double** design = v1::experimental::MakeDesignMatrix(sizes.data(), k, &status);
    if (!design) return status;
    const int code = v1::experimental::PerformLeveneMethod(
        design, static_cast<unsigned>(N), k, y.data(), &test->leveneStatistic, &test->levenePValue);
    v1::experimental::DeleteAugmentedDesignMatrix(&design, k + 1);
    return code;
  } catch (const std::bad_alloc&) {
    return qelFailOutOfMemory;
  }
}

namespace {

// The general form on variances already computed.
int runGeneral(VariancesTest* test, double confidence) {
  VariancesTestSample* s = test->samples;
  const unsigned k = test->k;
  int code = qelOk;
  for (unsigned i = 0; i < k; ++i) {
    s[i].thirdWorkValue = s[i].variance;
    const int c =
        PerformBonettMethod(&s[i].lowerLimit, &s[i].upperLimit, &s[i].thirdWorkValue,
                            test->individualConfidence, s[i].data, s[i].n, kIntervalTwoSided);
    code = std::max(code, c);
  }
  double z = kNaN;
  if (k > 2) {
    CalcVMulSample(test);
    CalcPForMulSample(test);
    z = rangeQuantile(confidence, k);
  } else if (k == 2) {
    CalcVTwoSample(test);
    z = PerformMCTwoSample(test, confidence);
  }
  comparisonLimits(test, z);
  if (k >= 2) code = std::max(code, PerformMultipleLevene(test));
  return code;
}

// The variances and the individual confidence; false for a bad call.
bool prepare(VariancesTest* test, double confidence) {
  if (!(confidence > 0.0 && confidence < 1.0)) return false;
  if (test->k > 0 && !test->samples) return false;
  computeVariances(test);
  test->individualConfidence = test->k > 0 ? 1.0 - (1.0 - confidence) / test->k : kNaN;
  return true;
}

}  // namespace

int RunVariancesTest(VariancesTest* test, double confidence) {
  if (!prepare(test, confidence)) return qelFailBadEnumValue;
  return runGeneral(test, confidence);
}

int RunVariancesTest(VariancesTest* test, double confidence, bool assumeNormal) {
  if (!prepare(test, confidence)) return qelFailBadEnumValue;
  return assumeNormal ? RunVariancesTestNormal(test) : runGeneral(test, confidence);
}

}  // namespace v0
}  // namespace qel
