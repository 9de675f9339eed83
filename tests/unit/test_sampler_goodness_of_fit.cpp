// Every family of the sampler: 1e5 draws from a fixed seed pass a
// Kolmogorov-Smirnov test (continuous) or a chi-square test (discrete) against
// the distribution object's own Cdf or Pdf at significance 1e-4, and the sample
// mean and variance lie within 5 standard errors of the family's moments.
// Parameters in the body and at awkward values (tiny gamma and beta shapes,
// p near 0 and 1, a huge Poisson mean). The Kolmogorov distribution is the
// asymptotic series, the chi-square tail that of the library.
#include <gtest/gtest.h>
#include <qel/sampler.h>

#include <algorithm>
#include <cmath>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "utilities/distributions/classes.h"
#include "utilities/distributions/kernels.h"

namespace {

using qel::ISampler;

constexpr unsigned kDraws = 100000;
constexpr double kSignificance = 1e-4;
constexpr double kSeed = 12345.0;
const double kNoMoment = std::nan("");

struct SamplerDeleter {
  void operator()(ISampler* s) const { qel::DeleteISampler(&s); }
};
using SamplerPtr = std::unique_ptr<ISampler, SamplerDeleter>;

SamplerPtr makeSampler(double seed = kSeed) {
  int code = -1;
  SamplerPtr sampler(qel::MakeISampler(&code, seed, qel::kRngCombinedCongruential));
  EXPECT_EQ(code, 0);
  return sampler;
}

// P(sqrt(n) D > x) for the asymptotic Kolmogorov distribution.
double kolmogorovSurvival(double x) {
  if (x < 0.2) return 1.0;
  double sum = 0.0;
  for (int k = 1; k <= 100; ++k) sum += (k % 2 ? 2.0 : -2.0) * std::exp(-2.0 * k * k * x * x);
  return sum;
}

double ksPValue(std::vector<double> x, const qel::CmDist& dist) {
  std::sort(x.begin(), x.end());
  const double n = x.size();
  double d = 0.0;
  for (std::size_t i = 0; i < x.size(); ++i) {
    const double f = dist.mCdf(x[i], false);
    d = std::max({d, (i + 1) / n - f, f - i / n});
  }
  return kolmogorovSurvival(std::sqrt(n) * d);
}

// Chi-square over the integers seen, with the two tails beyond them, bins
// merged left to right until each expects at least 5.
double chiSquarePValue(const std::vector<double>& x, const qel::CmDist& dist) {
  const double lo = *std::min_element(x.begin(), x.end());
  const double hi = *std::max_element(x.begin(), x.end());
  std::vector<double> observed(static_cast<std::size_t>(hi - lo) + 1, 0.0);
  for (double v : x) observed[static_cast<std::size_t>(v - lo)] += 1.0;
  const double n = x.size();
  std::vector<double> expected(observed.size());
  for (std::size_t k = 0; k < observed.size(); ++k) expected[k] = n * dist.mPdf(lo + k);
  expected.front() += n * dist.mCdf(lo - 1.0, false);
  expected.back() += n * dist.mCdf(hi + 1.0, true);
  double stat = 0.0, o = 0.0, e = 0.0;
  int bins = 0;
  for (std::size_t k = 0; k < observed.size(); ++k) {
    o += observed[k];
    e += expected[k];
    if (e >= 5.0 || k + 1 == observed.size()) {
      stat += (o - e) * (o - e) / e;
      ++bins;
      o = e = 0.0;
    }
  }
  if (bins < 2) return 1.0;  // one bin holds everything: nothing to test
  return qel::mChiSqCdf(stat, bins - 1, 0.0, true);
}

// Sample mean and variance against the family's, within 5 standard errors
// (the variance's error from the sample fourth central moment).
void expectMoments(const std::vector<double>& x, double mean, double variance,
                   const std::string& label) {
  const double n = x.size();
  double m = 0.0;
  for (double v : x) m += v;
  m /= n;
  double m2 = 0.0, m4 = 0.0;
  for (double v : x) {
    const double d = (v - m) * (v - m);
    m2 += d;
    m4 += d * d;
  }
  m2 /= n;
  m4 /= n;
  if (!std::isnan(mean) && !std::isnan(variance)) {
    EXPECT_NEAR(m, mean, 5.0 * std::sqrt(variance / n)) << label;
  }
  if (!std::isnan(variance)) {
    EXPECT_NEAR(m2 * n / (n - 1), variance, 5.0 * std::sqrt((m4 - m2 * m2) / n)) << label;
  }
}

struct Case {
  std::string label;
  std::function<int(ISampler&, double*)> draw;
  std::function<qel::CmDist*()> dist;
  double mean;
  double variance;
  unsigned draws = kDraws;
};

void runCases(const std::vector<Case>& cases, bool continuous) {
  SamplerPtr sampler = makeSampler();
  for (const Case& c : cases) {
    std::vector<double> x(c.draws);
    EXPECT_EQ(c.draw(*sampler, x.data()), 0) << c.label;
    std::unique_ptr<qel::CmDist> dist(c.dist());
    ASSERT_TRUE(dist->mAreParamsValid()) << c.label;
    const double p = continuous ? ksPValue(x, *dist) : chiSquarePValue(x, *dist);
    EXPECT_GT(p, kSignificance) << c.label;
    expectMoments(x, c.mean, c.variance, c.label);
  }
}

const double kPi = 3.141592653589793;
const double kEuler = 0.5772156649015329;

TEST(SamplerGoodnessOfFit, ContinuousByInversionAndPolar) {
  const double g1 = std::tgamma(1 + 1 / 1.5), g2 = std::tgamma(1 + 2 / 1.5);
  const double lam = 0.14;
  const double lambdaVar =
      2 / (lam * lam) *
      (1 / (1 + 2 * lam) - std::pow(std::tgamma(lam + 1), 2) / std::tgamma(2 * lam + 2));
  const double s = 0.2;  // log-logistic scale
  const double ll1 = kPi * s / std::sin(kPi * s);
  const double ll2 = 2 * kPi * s / std::sin(2 * kPi * s);
  runCases(
      {{"normal(1, 2)", [](ISampler& s, double* o) { return s.Normal(o, kDraws, 1, 2); },
        [] { return new qel::CmDistNormal(1, 2); }, 1, 4},
       {"uniform(-1, 3)", [](ISampler& s, double* o) { return s.Uniform(o, kDraws, -1.0, 3.0); },
        [] { return new qel::CmDistUniform(-1, 3); }, 1, 16.0 / 12},
       {"exponential(2, 1)", [](ISampler& s, double* o) { return s.Exponential(o, kDraws, 2, 1); },
        [] { return new qel::CmDistExponential(2, 1); }, 3, 4},
       {"cauchy(1, 0.5)", [](ISampler& s, double* o) { return s.Cauchy(o, kDraws, 1, 0.5); },
        [] { return new qel::CmDistCauchy(1, 0.5); }, kNoMoment, kNoMoment},
       {"laplace(-2, 3)", [](ISampler& s, double* o) { return s.Laplace(o, kDraws, -2, 3); },
        [] { return new qel::CmDistLaplace(-2, 3); }, -2, 18},
       {"largest extreme value(1, 2)",
        [](ISampler& s, double* o) { return s.LargestExtremeValue(o, kDraws, 1, 2); },
        [] { return new qel::CmDistLargestExtremeValue(1, 2); }, 1 + 2 * kEuler, kPi * kPi * 4 / 6},
       {"smallest extreme value(1, 2)",
        [](ISampler& s, double* o) { return s.SmallestExtremeValue(o, kDraws, 1, 2); },
        [] { return new qel::CmDistSmallestExtremeValue(1, 2); }, 1 - 2 * kEuler,
        kPi * kPi * 4 / 6},
       {"logistic(3, 0.5)", [](ISampler& s, double* o) { return s.Logistic(o, kDraws, 3, 0.5); },
        [] { return new qel::CmDistLogistic(3, 0.5); }, 3, kPi * kPi * 0.25 / 3},
       {"loglogistic(0.5, 0.2, 1)",
        [](ISampler& s, double* o) { return s.LogLogistic(o, kDraws, 0.5, 0.2, 1); },
        [] { return new qel::CmDistLogLogistic(0.5, 0.2, 1); }, 1 + std::exp(0.5) * ll1,
        std::exp(1.0) * (ll2 - ll1 * ll1)},
       {"lognormal(0.5, 0.4, 2)",
        [](ISampler& s, double* o) { return s.LogNormal(o, kDraws, 0.5, 0.4, 2); },
        [] { return new qel::CmDistLogNormal(0.5, 0.4, 2); }, 2 + std::exp(0.5 + 0.08),
        (std::exp(0.16) - 1) * std::exp(1 + 0.16)},
       {"lambda(0.14, 1, 2)",
        [](ISampler& s, double* o) { return s.Lambda(o, kDraws, 0.14, 1, 2); },
        [] { return new qel::CmDistLambda(0.14, 1, 2); }, 1, 4 * lambdaVar},
       {"triangular(0, 1, 4)",
        [](ISampler& s, double* o) { return s.Triangular(o, kDraws, 0, 1, 4); },
        [] { return new qel::CmDistTriangular(0, 1, 4); }, 5.0 / 3, (16.0 + 1 - 4) / 18},
       {"weibull(1.5, 2, 0.5)",
        [](ISampler& s, double* o) { return s.Weibull(o, kDraws, 1.5, 2, 0.5); },
        [] { return new qel::CmDistWeibull(1.5, 2, 0.5); }, 0.5 + 2 * g1, 4 * (g2 - g1 * g1)}},
      true);
}

double gammaMean(double k, double theta) {
  return k * theta;
}
double gammaVar(double k, double theta) {
  return k * theta * theta;
}

TEST(SamplerGoodnessOfFit, GammaEveryGeneratorAndTinyShapes) {
  std::vector<Case> cases;
  for (double shape : {0.01, 0.3, 0.999, 1.0, 1.001, 2.5, 3.999, 4.0, 7.5, 1e4}) {
    cases.push_back(
        {"gamma shape " + std::to_string(shape),
         [shape](ISampler& s, double* o) { return s.Gamma(o, kDraws, shape, 1.5, 0.0); },
         [shape] { return new qel::CmDistGamma(shape, 1.5, 0.0); }, gammaMean(shape, 1.5),
         gammaVar(shape, 1.5)});
  }
  cases.push_back({"chi-square 3", [](ISampler& s, double* o) { return s.ChiSq(o, kDraws, 3, 0); },
                   [] { return new qel::CmDistChiSq(3, 0); }, 3, 6});
  runCases(cases, true);
}

TEST(SamplerGoodnessOfFit, BetaFAndT) {
  std::vector<Case> cases;
  const double shapes[][2] = {{2, 3},   {3, 2}, {5, 5},    {0.5, 0.5}, {0.05, 0.5}, {5, 0.3},
                              {0.3, 5}, {1, 1}, {0.01, 2}, {0.5, 0.2}, {40, 0.9}};
  for (const auto& ab : shapes) {
    const double a = ab[0], b = ab[1];
    cases.push_back({"beta(" + std::to_string(a) + ", " + std::to_string(b) + ")",
                     [a, b](ISampler& s, double* o) { return s.Beta(o, kDraws, a, b); },
                     [a, b] { return new qel::CmDistBeta(a, b); }, a / (a + b),
                     a * b / ((a + b) * (a + b) * (a + b + 1))});
  }
  cases.push_back({"F(5, 10)", [](ISampler& s, double* o) { return s.F(o, kDraws, 5, 10, 0); },
                   [] { return new qel::CmDistF(5, 10, 0); }, 10.0 / 8,
                   2 * 100.0 * 13 / (5 * 64.0 * 6)});
  cases.push_back({"F(0.5, 3)", [](ISampler& s, double* o) { return s.F(o, kDraws, 0.5, 3, 0); },
                   [] { return new qel::CmDistF(0.5, 3, 0); }, kNoMoment, kNoMoment});
  cases.push_back({"t(6)", [](ISampler& s, double* o) { return s.T(o, kDraws, 6, 0); },
                   [] { return new qel::CmDistT(6, 0); }, 0, 1.5});
  // Noncentral t is drawn by inversion through a root search: 5000 draws.
  const double nu = 8, delta = 1.5;
  const double tMean =
      delta * std::sqrt(nu / 2) * std::exp(std::lgamma((nu - 1) / 2) - std::lgamma(nu / 2));
  cases.push_back({"t(8, 1.5)", [](ISampler& s, double* o) { return s.T(o, 5000, 8, 1.5); },
                   [] { return new qel::CmDistT(8, 1.5); }, tMean,
                   nu * (1 + delta * delta) / (nu - 2) - tMean * tMean, 5000});
  cases.push_back({"t(1)", [](ISampler& s, double* o) { return s.T(o, kDraws, 1, 0); },
                   [] { return new qel::CmDistT(1, 0); }, kNoMoment, kNoMoment});
  runCases(cases, true);
}

TEST(SamplerGoodnessOfFit, DiscreteFamilies) {
  std::vector<Case> cases = {
      {"bernoulli(0.3)", [](ISampler& s, double* o) { return s.Bernoulli(o, kDraws, 0.3); },
       [] { return new qel::CmDistBernoulli(0.3); }, 0.3, 0.21},
      {"binomial(20, 0.3)", [](ISampler& s, double* o) { return s.Binomial(o, kDraws, 20, 0.3); },
       [] { return new qel::CmDistBinomial(20, 0.3); }, 6, 4.2},
      {"binomial(50, 0.002)",
       [](ISampler& s, double* o) { return s.Binomial(o, kDraws, 50, 0.002); },
       [] { return new qel::CmDistBinomial(50, 0.002); }, 0.1, 50 * 0.002 * 0.998},
      {"binomial(30, 0.999)",
       [](ISampler& s, double* o) { return s.Binomial(o, kDraws, 30, 0.999); },
       [] { return new qel::CmDistBinomial(30, 0.999); }, 29.97, 30 * 0.999 * 0.001},
      {"poisson(3)", [](ISampler& s, double* o) { return s.Poisson(o, kDraws, 3); },
       [] { return new qel::CmDistPoisson(3); }, 3, 3},
      {"poisson(0.01)", [](ISampler& s, double* o) { return s.Poisson(o, kDraws, 0.01); },
       [] { return new qel::CmDistPoisson(0.01); }, 0.01, 0.01},
      // Inversion at a huge mean costs tens of microseconds a draw: 2e4 draws.
      {"poisson(1e6)", [](ISampler& s, double* o) { return s.Poisson(o, 20000, 1e6); },
       [] { return new qel::CmDistPoisson(1e6); }, 1e6, 1e6, 20000},
      {"negative binomial trials(3, 0.4)",
       [](ISampler& s, double* o) { return s.NegBinomial(o, kDraws, 3, 0.4, true); },
       [] { return new qel::CmDistNegBinomial(0.4, 3, false); }, 3 / 0.4, 3 * 0.6 / 0.16},
      {"negative binomial failures(5, 0.9)",
       [](ISampler& s, double* o) { return s.NegBinomial(o, kDraws, 5, 0.9, false); },
       [] { return new qel::CmDistNegBinomial(0.9, 5, true); }, 5 * 0.1 / 0.9, 5 * 0.1 / 0.81},
      {"geometric trials(0.2)",
       [](ISampler& s, double* o) { return s.Geometric(o, kDraws, 0.2, true); },
       [] { return new qel::CmDistGeometric(0.2, false); }, 5, 0.8 / 0.04},
      {"geometric failures(0.02)",
       [](ISampler& s, double* o) { return s.Geometric(o, kDraws, 0.02, false); },
       [] { return new qel::CmDistGeometric(0.02, true); }, 49, 0.98 / 0.0004},
      {"hypergeometric(50, 20, 10)",
       [](ISampler& s, double* o) { return s.Hypergeometric(o, kDraws, 50, 20, 10); },
       [] { return new qel::CmDistHypergeometric(50, 20, 10); }, 4, 10 * 0.4 * 0.6 * 40 / 49},
      {"integer uniform(-3, 7)", [](ISampler& s, double* o) { return s.Uniform(o, kDraws, -3, 7); },
       [] { return new qel::CmDistIntegerUniform(-3, 7); }, 2, (121.0 - 1) / 12}};
  runCases(cases, false);
}

}  // namespace
