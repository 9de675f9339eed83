// Every family of the sampler: 1e5 draws from a fixed seed pass a
// Kolmogorov-Smirnov test (continuous) or a chi-square test (discrete) against
// the distribution object's own Cdf or Pdf at significance 1e-4, and the sample
// mean and variance lie within 5 standard errors of the family's moments
// (tools/reference/gen_sampler_moments.py).
// Parameters in the body and at awkward values (tiny gamma and beta shapes,
// p near 0 and 1, a huge Poisson mean). The Kolmogorov distribution is the
// asymptotic series, the chi-square tail that of the library.
#include <gtest/gtest.h>
#include <qel/sampler.h>

#include <algorithm>
#include <cmath>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "reference_data.h"
#include "utilities/distributions/classes.h"
#include "utilities/distributions/kernels.h"

namespace {

using qel::ISampler;

constexpr double kSignificance = 1e-4;
constexpr double kSeed = 12345.0;

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

using Params = std::vector<double>;
struct Family {
  std::function<int(ISampler&, double*, unsigned, const Params&)> draw;
  std::function<qel::CmDist*(const Params&)> dist;
};

int whole(double x) {
  return static_cast<int>(x);
}

// The sampler call and the distribution object of each family of
// sampler_families.csv, parameters in the order of the call.
const std::map<std::string, Family>& families() {
  using S = ISampler&;
  using P = const Params&;
  static const std::map<std::string, Family> table = {
      {"normal",
       {[](S s, double* o, unsigned n, P p) { return s.Normal(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistNormal(p[0], p[1]); }}},
      {"uniform",
       {[](S s, double* o, unsigned n, P p) { return s.Uniform(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistUniform(p[0], p[1]); }}},
      {"exponential",
       {[](S s, double* o, unsigned n, P p) { return s.Exponential(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistExponential(p[0], p[1]); }}},
      {"cauchy",
       {[](S s, double* o, unsigned n, P p) { return s.Cauchy(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistCauchy(p[0], p[1]); }}},
      {"laplace",
       {[](S s, double* o, unsigned n, P p) { return s.Laplace(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistLaplace(p[0], p[1]); }}},
      {"largest_extreme_value",
       {[](S s, double* o, unsigned n, P p) { return s.LargestExtremeValue(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistLargestExtremeValue(p[0], p[1]); }}},
      {"smallest_extreme_value",
       {[](S s, double* o, unsigned n, P p) { return s.SmallestExtremeValue(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistSmallestExtremeValue(p[0], p[1]); }}},
      {"logistic",
       {[](S s, double* o, unsigned n, P p) { return s.Logistic(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistLogistic(p[0], p[1]); }}},
      {"loglogistic",
       {[](S s, double* o, unsigned n, P p) { return s.LogLogistic(o, n, p[0], p[1], p[2]); },
        [](P p) { return new qel::CmDistLogLogistic(p[0], p[1], p[2]); }}},
      {"lognormal",
       {[](S s, double* o, unsigned n, P p) { return s.LogNormal(o, n, p[0], p[1], p[2]); },
        [](P p) { return new qel::CmDistLogNormal(p[0], p[1], p[2]); }}},
      {"lambda",
       {[](S s, double* o, unsigned n, P p) { return s.Lambda(o, n, p[0], p[1], p[2]); },
        [](P p) { return new qel::CmDistLambda(p[0], p[1], p[2]); }}},
      {"triangular",
       {[](S s, double* o, unsigned n, P p) { return s.Triangular(o, n, p[0], p[1], p[2]); },
        [](P p) { return new qel::CmDistTriangular(p[0], p[1], p[2]); }}},
      {"weibull",
       {[](S s, double* o, unsigned n, P p) { return s.Weibull(o, n, p[0], p[1], p[2]); },
        [](P p) { return new qel::CmDistWeibull(p[0], p[1], p[2]); }}},
      {"gamma",
       {[](S s, double* o, unsigned n, P p) { return s.Gamma(o, n, p[0], p[1], p[2]); },
        [](P p) { return new qel::CmDistGamma(p[0], p[1], p[2]); }}},
      {"chisq",
       {[](S s, double* o, unsigned n, P p) { return s.ChiSq(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistChiSq(p[0], p[1]); }}},
      {"beta",
       {[](S s, double* o, unsigned n, P p) { return s.Beta(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistBeta(p[0], p[1]); }}},
      {"F",
       {[](S s, double* o, unsigned n, P p) { return s.F(o, n, p[0], p[1], p[2]); },
        [](P p) { return new qel::CmDistF(p[0], p[1], p[2]); }}},
      {"t",
       {[](S s, double* o, unsigned n, P p) { return s.T(o, n, p[0], p[1]); },
        [](P p) { return new qel::CmDistT(p[0], p[1]); }}},
      {"bernoulli",
       {[](S s, double* o, unsigned n, P p) { return s.Bernoulli(o, n, p[0]); },
        [](P p) { return new qel::CmDistBernoulli(p[0]); }}},
      {"binomial",
       {[](S s, double* o, unsigned n, P p) { return s.Binomial(o, n, whole(p[0]), p[1]); },
        [](P p) { return new qel::CmDistBinomial(whole(p[0]), p[1]); }}},
      {"poisson",
       {[](S s, double* o, unsigned n, P p) { return s.Poisson(o, n, p[0]); },
        [](P p) { return new qel::CmDistPoisson(p[0]); }}},
      // The objects' flag counts failures, the sampler's trials.
      {"negative_binomial",
       {[](S s, double* o, unsigned n, P p) {
          return s.NegBinomial(o, n, whole(p[0]), p[1], p[2] != 0);
        },
        [](P p) { return new qel::CmDistNegBinomial(p[1], p[0], p[2] == 0); }}},
      {"geometric",
       {[](S s, double* o, unsigned n, P p) { return s.Geometric(o, n, p[0], p[1] != 0); },
        [](P p) { return new qel::CmDistGeometric(p[0], p[1] == 0); }}},
      {"hypergeometric",
       {[](S s, double* o, unsigned n, P p) {
          return s.Hypergeometric(o, n, whole(p[0]), whole(p[1]), whole(p[2]));
        },
        [](P p) { return new qel::CmDistHypergeometric(whole(p[0]), whole(p[1]), whole(p[2])); }}},
      {"integer_uniform",
       {[](S s, double* o, unsigned n, P p) { return s.Uniform(o, n, whole(p[0]), whole(p[1])); },
        [](P p) { return new qel::CmDistIntegerUniform(whole(p[0]), whole(p[1])); }}},
  };
  return table;
}

// Every continuous (or discrete) row of sampler_families.csv, drawn in turn
// from one stream.
void checkFamilies(bool continuous, std::size_t atLeast) {
  SamplerPtr sampler = makeSampler();
  std::size_t checked = 0;
  for (const auto& row : qeltest::loadReferenceData("sampler_families.csv", 1)) {
    const auto& v = row.numbers;
    if ((v[0] != 0) != continuous) continue;
    const Params p(v.begin() + 2, v.begin() + 5);
    const std::string label = row.text[0] + " line " + std::to_string(row.line);
    ASSERT_EQ(families().count(row.text[0]), 1u) << label;
    const Family& family = families().at(row.text[0]);
    std::vector<double> x(static_cast<std::size_t>(v[1]));
    EXPECT_EQ(family.draw(*sampler, x.data(), static_cast<unsigned>(x.size()), p), 0) << label;
    std::unique_ptr<qel::CmDist> dist(family.dist(p));
    ASSERT_TRUE(dist->mAreParamsValid()) << label;
    EXPECT_GT(continuous ? ksPValue(x, *dist) : chiSquarePValue(x, *dist), kSignificance) << label;
    expectMoments(x, v[5], v[6], label);
    ++checked;
  }
  EXPECT_GE(checked, atLeast);
}

// Inversion and the polar method; the gamma family through every generator
// (the shape picks it), tiny shapes; beta, F and t, noncentral t.
TEST(SamplerGoodnessOfFit, ContinuousFamilies) {
  checkFamilies(true, 40);
}

TEST(SamplerGoodnessOfFit, DiscreteFamilies) {
  checkFamilies(false, 13);
}

}  // namespace
