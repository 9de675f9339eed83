// The sampler interface and the objects behind it: the factory's codes, the
// seed positions, the argument mapping of the operations, the alias sampler
// on awkward tables (1e6 draws), random samples with and without
// replacement, the multivariate normal, bad parameters, and the rules of the
// distribution objects (dispatch, validity, support, bounds).
#include <gtest/gtest.h>
#include <qel/sampler.h>

#include <algorithm>
#include <cmath>
#include <memory>
#include <set>
#include <stdexcept>
#include <typeinfo>
#include <vector>

#include "fpu_state.h"
#include "interfaces/math/rngs.h"
#include "interfaces/math/rngs_sampling.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/classes.h"
#include "utilities/distributions/kernels.h"

namespace {

using qel::ISampler;

struct SamplerDeleter {
  void operator()(ISampler* s) const { qel::DeleteISampler(&s); }
};
using SamplerPtr = std::unique_ptr<ISampler, SamplerDeleter>;

SamplerPtr makeSampler(double seed) {
  int code = -1;
  SamplerPtr sampler(qel::MakeISampler(&code, seed, qel::kRngCombinedCongruential));
  EXPECT_EQ(code, 0);
  return sampler;
}

TEST(SamplerFactory, CodesForGeneratorsAndDeletion) {
  int code = -1;
  for (int rng : {3, 0, 11}) {
    EXPECT_EQ(qel::MakeISampler(&code, 1.0, qel::BasicRng(rng)), nullptr);
    EXPECT_EQ(code, rng == 11 ? qel::qelFailUnknownSelector : qel::qelFailNotImplemented);
  }
  ISampler* sampler = qel::MakeISampler(&code, 1.0, qel::kRngCombinedCongruential);
  ASSERT_NE(sampler, nullptr);
  EXPECT_EQ(code, 0);
  EXPECT_TRUE(qeltest::isDefaultState());
  qel::DeleteISampler(&sampler);
  EXPECT_EQ(sampler, nullptr);
  qel::DeleteISampler(&sampler);  // a null pointer is left alone
  EXPECT_EQ(sampler, nullptr);
}

TEST(SamplerFactory, SeedsNameStreamPositions) {
  // Seed 0 at the factory is the clock; SetSeed(0) is the state (1, 1, 1).
  SamplerPtr clock = makeSampler(0.0);
  EXPECT_NE(clock->GetSeed(), 0.0);
  clock->SetSeed(0.0);
  EXPECT_EQ(clock->GetSeed(), 0.0);

  SamplerPtr a = makeSampler(987654321.0), b = makeSampler(987654321.0);
  std::vector<double> x(500), y(500), z(300);
  a->Gamma(x.data(), 200, 2.5, 1, 0);
  b->Gamma(y.data(), 200, 2.5, 1, 0);
  EXPECT_EQ(x, y);
  // The position after draws, handed to another sampler, continues exactly.
  SamplerPtr c = makeSampler(5.0);
  c->SetSeed(a->GetSeed());
  a->Uniform(x.data(), 300, 0.0, 1.0);
  c->Uniform(z.data(), 300, 0.0, 1.0);
  EXPECT_TRUE(std::equal(z.begin(), z.end(), x.begin()));
}

TEST(SamplerOperations, ArgumentMapping) {
  std::vector<double> x(1000), y(1000);
  SamplerPtr a = makeSampler(42.0), b = makeSampler(42.0);
  // The second double of ChiSq is not used.
  a->ChiSq(x.data(), 1000, 3.0, 0.0);
  b->ChiSq(y.data(), 1000, 3.0, 17.0);
  EXPECT_EQ(x, y);
  // Log-normal: exp of the normal draws of the same stream, plus threshold.
  a->SetSeed(77.0);
  b->SetSeed(77.0);
  a->LogNormal(x.data(), 1000, 0.3, 0.7, 2.0);
  b->Normal(y.data(), 1000, 0.3, 0.7);
  for (int i = 0; i < 1000; ++i) EXPECT_DOUBLE_EQ(x[i], std::exp(y[i]) + 2.0);
  // Geometric is the negative binomial with one success; the flag counts
  // trials (from 1) or failures (from 0).
  a->SetSeed(9.0);
  b->SetSeed(9.0);
  a->Geometric(x.data(), 1000, 0.3, true);
  b->NegBinomial(y.data(), 1000, 1, 0.3, true);
  EXPECT_EQ(x, y);
  EXPECT_EQ(*std::min_element(x.begin(), x.end()), 1.0);
  a->Geometric(x.data(), 1000, 0.3, false);
  EXPECT_EQ(*std::min_element(x.begin(), x.end()), 0.0);
  // Pareto and Rayleigh are slots only.
  std::vector<double> untouched(5, -7.0);
  EXPECT_EQ(a->Pareto(untouched.data(), 5, 1, 1), qel::qelFailNotImplemented);
  EXPECT_EQ(a->Rayleigh(untouched.data(), 5, 1, 1), qel::qelFailNotImplemented);
  EXPECT_EQ(untouched, std::vector<double>(5, -7.0));
  EXPECT_TRUE(qeltest::isDefaultState());
}

TEST(SamplerOperations, BadParametersGiveCodesNotCrashes) {
  SamplerPtr s = makeSampler(3.0);
  std::vector<double> x(100);
  // Rejection generators refuse shapes they cannot draw from.
  EXPECT_EQ(s->Gamma(x.data(), 100, -1.0, 1, 0), qel::qelFailRandomVariate);
  EXPECT_TRUE(qel::mIsNumericMissing(x[0]));
  EXPECT_EQ(s->Gamma(x.data(), 100, 0.0, 1, 0), qel::qelFailRandomVariate);
  EXPECT_EQ(s->Beta(x.data(), 100, 0.0, 2.0), qel::qelFailRandomVariate);
  EXPECT_EQ(s->ChiSq(x.data(), 100, -2.0, 0.0), qel::qelFailRandomVariate);
  EXPECT_EQ(s->F(x.data(), 100, 0.0, 3.0, 0.0), qel::qelFailRandomVariate);
  EXPECT_EQ(s->T(x.data(), 100, -1.0, 0.0), qel::qelFailRandomVariate);
  EXPECT_EQ(s->NegBinomial(x.data(), 100, 2, 0.0, true), qel::qelFailRandomVariate);
  EXPECT_EQ(s->NegBinomial(x.data(), 100, 2, 1.5, true), qel::qelFailRandomVariate);
  EXPECT_EQ(s->Geometric(x.data(), 100, 1.0, true), qel::qelFailRandomVariate);
  // Other families fill the array by their own rule and report 0.
  EXPECT_EQ(s->Normal(x.data(), 100, 0.0, -1.0), 0);
  EXPECT_EQ(s->Binomial(x.data(), 100, 0, 0.5), 0);
  EXPECT_EQ(x[0], 0.0);
  EXPECT_EQ(s->Bernoulli(x.data(), 100, 1.5), 0);
  EXPECT_EQ(s->Hypergeometric(x.data(), 100, 5, 9, 3), qel::qelFailBadEnumValue);
  // Weibull returns 0 whatever its parameters.
  EXPECT_EQ(s->Weibull(x.data(), 100, -1.0, -2.0, 0), 0);
  // n = 0 draws nothing; a null array with elements to fill is refused.
  EXPECT_EQ(s->Normal(nullptr, 0, 0.0, 1.0), 0);
  EXPECT_EQ(s->Normal(nullptr, 10, 0.0, 1.0), qel::qelFailRandomVariate);
  EXPECT_EQ(s->RandomSample(nullptr, 10, 3, true), qel::qelFailRandomVariate);
  const double values[] = {1.0};
  EXPECT_EQ(s->Discrete(x.data(), 10, values, values, 0), qel::qelFailRandomVariate);
  // Weights without a positive finite sum, or with a negative one, are
  // refused before any draw.
  const double table[] = {1, 2, 3}, zeros[] = {0, 0, 0}, negative[] = {-1, 2, 1},
               huge[] = {1e308, 1e308, 1e308}, nan[] = {1, std::nan(""), 1};
  for (const double* weights : {zeros, negative, huge, nan}) {
    x[0] = -9.0;
    EXPECT_EQ(s->Discrete(x.data(), 100, table, weights, 3), qel::qelFailRandomVariate);
    EXPECT_EQ(x[0], -9.0);
  }
  // A NaN parameter meets the armed frame's trap at its first comparison: the
  // invalid-operation exception passes on to the caller (which resets the
  // state), as from the distribution functions.
  EXPECT_THROW(s->Gamma(x.data(), 10, std::nan(""), 1, 0), std::invalid_argument);
  qel::ResetFpuStates();
  EXPECT_EQ(s->Binomial(x.data(), 10, 5, std::nan("")), qel::qelFailBadEnumValue);
  // Masked overflow of the huge weights leaves a sticky flag; the control
  // bits must be the default ones.
  EXPECT_EQ(qeltest::x87ControlWord(), qeltest::kDefaultX87);
  EXPECT_EQ(qeltest::mxcsr() & ~0x3Fu, qeltest::kDefaultMxcsr);
}

// ---------------------------------------------------------------------------
// Alias sampler.

TEST(AliasSampler, CanonicalFormMergesAndSorts) {
  const double values[] = {2, 1, 3, 2};
  const double probabilities[] = {0.2, 0.1, 0.4, 0.3};
  const double* v = values;
  const double* p = probabilities;
  unsigned count = 4;
  ASSERT_EQ(qel::v1::CreatePseudoPmf(&v, &p, &count), 0);
  ASSERT_EQ(count, 3u);
  EXPECT_EQ(std::vector<double>(v, v + 3), (std::vector<double>{1, 2, 3}));
  EXPECT_DOUBLE_EQ(p[0], 0.1);
  EXPECT_DOUBLE_EQ(p[1], 0.5);
  EXPECT_DOUBLE_EQ(p[2], 0.4);
  EXPECT_EQ(values[0], 2.0);  // the caller's arrays are untouched
  delete[] v;
  delete[] p;
}

TEST(AliasSampler, EqualWeightsReturnTheCellOfTheUniform) {
  const double weights[] = {3, 3, 3, 3, 3};
  qel::v1::SamplingWithReplace alias(weights, 5);
  qel::CmUniformGenerator g(11.0), h(11.0);
  alias.SetBrng(&g);
  for (int i = 0; i < 1000; ++i) EXPECT_EQ(alias.GetValue(), unsigned(h.mGetRandom() * 5));
}

// Draws x against the weights of the support: outcomes of weight 0 never
// drawn, the others fitting at significance 1e-4.
void expectFit(const std::vector<double>& x, const std::vector<double>& support,
               const std::vector<double>& expected) {
  std::vector<double> observed(support.size(), 0.0);
  for (double v : x) {
    const auto at = std::find(support.begin(), support.end(), v);
    ASSERT_NE(at, support.end()) << "value " << v << " is not in the table";
    observed[at - support.begin()] += 1.0;
  }
  double total = 0.0;
  for (double w : expected) total += w;
  double stat = 0.0;
  int bins = 0;
  for (std::size_t k = 0; k < support.size(); ++k) {
    const double e = x.size() * expected[k] / total;
    if (e == 0.0) {
      EXPECT_EQ(observed[k], 0.0) << "outcome of weight 0 drawn: " << support[k];
      continue;
    }
    stat += (observed[k] - e) * (observed[k] - e) / e;
    ++bins;
  }
  if (bins > 1) {
    EXPECT_GT(qel::mChiSqCdf(stat, bins - 1, 0.0, true), 1e-4);
  }
}

// 1e6 draws through Sampler::Discrete against the canonical weights.
void expectAliasFit(const std::vector<double>& values, const std::vector<double>& weights,
                    const std::vector<double>& support, const std::vector<double>& expected) {
  constexpr unsigned kN = 1000000;
  SamplerPtr s = makeSampler(2024.0);
  std::vector<double> x(kN);
  ASSERT_EQ(s->Discrete(x.data(), kN, values.data(), weights.data(),
                        static_cast<unsigned>(values.size())),
            0);
  expectFit(x, support, expected);
}

TEST(AliasSampler, ChiSquareFitOnAwkwardTables) {
  // Zero probabilities, at the ends and inside.
  expectAliasFit({1, 2, 3, 4, 5}, {0, 0.2, 0, 0.5, 0.3}, {1, 2, 3, 4, 5}, {0, 0.2, 0, 0.5, 0.3});
  // One point.
  expectAliasFit({7.5}, {0.3}, {7.5}, {1});
  // Duplicated values, unsorted: merged into sums.
  expectAliasFit({3, 1, 2, 2, 3, 1}, {0.1, 0.05, 0.2, 0.3, 0.25, 0.1}, {1, 2, 3},
                 {0.15, 0.5, 0.35});
  // Weights that do not sum to 1, over many cells of unequal size.
  std::vector<double> values, weights;
  for (int k = 0; k < 40; ++k) {
    values.push_back(k * 0.5 - 3);
    weights.push_back(k % 7 == 0 ? 0.0 : 1.0 + (k * 37 % 11));
  }
  expectAliasFit(values, weights, values, weights);
}

// ---------------------------------------------------------------------------

TEST(RandomSample, WithoutReplacementIsDistinctWithReplacementIsUniform) {
  SamplerPtr s = makeSampler(31.0);
  std::vector<unsigned> out(1000);
  for (unsigned population : {1u, 10u, 1000u}) {
    ASSERT_EQ(s->RandomSample(out.data(), population, population, true), 0);
    std::vector<unsigned> sorted(out.begin(), out.begin() + population);
    std::sort(sorted.begin(), sorted.end());
    for (unsigned i = 0; i < population; ++i) ASSERT_EQ(sorted[i], i);  // a permutation
  }
  ASSERT_EQ(s->RandomSample(out.data(), 100000, 1000, true), 0);
  EXPECT_EQ(std::set<unsigned>(out.begin(), out.end()).size(), 1000u);
  EXPECT_LT(*std::max_element(out.begin(), out.end()), 100000u);

  // With replacement: counts over 20 cells of 100000 draws.
  constexpr unsigned kN = 100000, kCells = 20;
  std::vector<unsigned> draws(kN);
  ASSERT_EQ(s->RandomSample(draws.data(), kCells, kN, false), 0);
  std::vector<double> counts(kCells, 0.0);
  for (unsigned d : draws) {
    ASSERT_LT(d, kCells);
    counts[d] += 1.0;
  }
  double stat = 0.0;
  for (double c : counts) stat += (c - kN / kCells) * (c - kN / kCells) / (kN / kCells);
  EXPECT_GT(qel::mChiSqCdf(stat, kCells - 1, 0.0, true), 1e-4);
}

// ---------------------------------------------------------------------------

TEST(MultivariateNormal, SampleCovarianceAndIndefiniteMatrix) {
  constexpr unsigned kN = 100000, kD = 3;
  const double mean[kD] = {1.0, -2.0, 0.5};
  // Lower triangle by rows of [[4, 1.2, -0.8], [1.2, 2, 0.3], [-0.8, 0.3, 1]].
  const double covariance[] = {4.0, 1.2, 2.0, -0.8, 0.3, 1.0};
  const double full[kD][kD] = {{4, 1.2, -0.8}, {1.2, 2, 0.3}, {-0.8, 0.3, 1}};
  std::vector<double> storage(kN * kD);
  std::vector<double*> rows(kN);
  for (unsigned i = 0; i < kN; ++i) rows[i] = &storage[i * kD];
  SamplerPtr s = makeSampler(8.0);
  ASSERT_EQ(s->MvNormal(rows.data(), kN, kD, mean, covariance), 0);
  double m[kD] = {0, 0, 0};
  for (unsigned i = 0; i < kN; ++i)
    for (unsigned j = 0; j < kD; ++j) m[j] += rows[i][j] / kN;
  for (unsigned j = 0; j < kD; ++j) EXPECT_NEAR(m[j], mean[j], 5 * std::sqrt(full[j][j] / kN));
  for (unsigned j = 0; j < kD; ++j)
    for (unsigned k = 0; k < kD; ++k) {
      double c = 0.0;
      for (unsigned i = 0; i < kN; ++i) c += (rows[i][j] - m[j]) * (rows[i][k] - m[k]);
      c /= kN - 1;
      // Standard error of a sample covariance: sqrt((s_jj s_kk + s_jk^2)/n).
      const double se = std::sqrt((full[j][j] * full[k][k] + full[j][k] * full[j][k]) / kN);
      EXPECT_NEAR(c, full[j][k], 5 * se) << j << "," << k;
    }

  // Indefinite: no draw, the array untouched.
  const double indefinite[] = {1.0, 2.0, 1.0, 0.0, 0.0, 1.0};
  storage.assign(kN * kD, -5.0);
  EXPECT_EQ(s->MvNormal(rows.data(), 10, kD, mean, indefinite), qel::qelFailNotPositiveDefinite);
  EXPECT_EQ(storage[0], -5.0);
  qel::CmDistMVNormal bad(mean, indefinite, kD);
  EXPECT_EQ(bad.GetMsgCode(), qel::qelFailNotPositiveDefinite);
  EXPECT_FALSE(bad.mAreParamsValid());
  EXPECT_TRUE(qeltest::isDefaultState());
}

// ---------------------------------------------------------------------------
// Rules of the distribution objects.

TEST(DistributionObjects, ValidityAndDegenerateDraws) {
  EXPECT_FALSE(qel::CmDistBinomial(0, 0.5).mAreParamsValid());
  EXPECT_TRUE(qel::CmDistBinomial(1, 1.0).mAreParamsValid());
  EXPECT_FALSE(qel::CmDistUniform(1, 1).mAreParamsValid());
  EXPECT_FALSE(qel::CmDistBernoulli(-0.1).mAreParamsValid());
  EXPECT_FALSE(qel::CmDistHypergeometric(10, 11, 3).mAreParamsValid());
  EXPECT_FALSE(qel::CmDistNegBinomial(1.0, 2, false).mAreParamsValid());
  EXPECT_FALSE(qel::CmDistTriangular(0, 3, 2).mAreParamsValid());
  qel::CmUniformGenerator g(99.0);
  qel::CmDistBernoulli certain(1.0);
  qel::CmDistHypergeometric all(10, 10, 3);
  certain.SetBrng(&g);
  all.SetBrng(&g);
  for (int i = 0; i < 1000; ++i) {
    EXPECT_EQ(certain.mGetRandom(), 1.0);
    EXPECT_EQ(all.mGetRandom(), 3.0);
  }
}

TEST(DistributionObjects, GammaDispatchAndNormalPairs) {
  EXPECT_EQ(typeid(*qel::CmDistGamma(1.0, 2, 0).mGetInner()), typeid(qel::CmDistExponential));
  EXPECT_EQ(typeid(*qel::CmDistGamma(0.999, 2, 0).mGetInner()), typeid(qel::CmDistGammaA));
  EXPECT_EQ(typeid(*qel::CmDistGamma(3.999, 2, 0).mGetInner()), typeid(qel::CmDistGammaB));
  EXPECT_EQ(typeid(*qel::CmDistGamma(4.0, 2, 0).mGetInner()), typeid(qel::CmDistGammaC));

  // Two normal draws come from one accepted pair (v1, v2) of the disc: the
  // first is v2 r, the second v1 r, r = sqrt(-2 ln s / s).
  qel::CmUniformGenerator g(555.0), h(555.0);
  qel::CmDistNormal normal(0.0, 1.0);
  normal.SetBrng(&g);
  const double first = normal.mGetRandom();
  const double second = normal.mGetRandom();
  double v1, v2, s;
  do {
    v1 = 2.0 * h.mGetRandom() - 1.0;
    v2 = 2.0 * h.mGetRandom() - 1.0;
    s = v1 * v1 + v2 * v2;
  } while (s > 1.0);
  EXPECT_EQ(g.mGetBase(), h.mGetBase());
  const double r = std::sqrt(-2.0 * std::log(s) / s);
  EXPECT_DOUBLE_EQ(first, v2 * r);
  EXPECT_DOUBLE_EQ(second, v1 * r);
}

TEST(DistributionObjects, ParametersSupportAndBounds) {
  std::vector<double> out;
  qel::CmDistChiSq(3, 2).mGetNonInvCDFParameters(out);
  EXPECT_EQ(out, std::vector<double>{3});
  qel::CmDistF(3, 4, 1).mGetNonInvCDFParameters(out);
  EXPECT_EQ(out, (std::vector<double>{3, 4}));
  qel::CmDistGamma(2, 3, 1).mGetParameters(out);
  EXPECT_EQ(out, (std::vector<double>{2, 3, 1}));
  qel::CmDistBinomial(5, 0.5).mGetSupport(-2.5, 3.5, out);
  EXPECT_EQ(out, (std::vector<double>{0, 1, 2, 3}));
  qel::CmDistHypergeometric(10, 7, 6).mGetSupport(0, 10, out);
  EXPECT_EQ(out, (std::vector<double>{3, 4, 5, 6}));
  qel::CmDistPoisson(2).mGetSupport(1.5, 4, out);
  EXPECT_EQ(out, (std::vector<double>{2, 3, 4}));
  qel::CmDistNegBinomial(0.5, 3, false).mGetSupport(0, 5, out);
  EXPECT_EQ(out, (std::vector<double>{3, 4, 5}));
  // Continuous families list nothing: the vector is left as it was.
  qel::CmDistNormal(0, 1).mGetSupport(0, 5, out);
  EXPECT_EQ(out, (std::vector<double>{3, 4, 5}));
  // A threshold far below the body is not worth showing; one near it is.
  EXPECT_TRUE(qel::CmDistExponential(1, 0).mHasLowerBound());
  EXPECT_FALSE(qel::CmDistGamma(400, 1, 0).mHasLowerBound());
  EXPECT_TRUE(qel::CmDistGamma(2, 1, 0).mHasLowerBound());
  // The objects' quantiles are the kernels': symmetric and tabulated cases.
  EXPECT_EQ(qel::CmDistBinomial(10, 0.5).mInvCdf(0.5), 5.0);
  EXPECT_NEAR(qel::CmDistBeta(2, 2).mInvCdf(0.5), 0.5, 1e-14);
  // t(10) 97.5% point by mpmath (findroot on the incomplete beta); F(1, 10)
  // 95% point is its square.
  const double t975 = 2.22813885198627471565;
  EXPECT_NEAR(qel::CmDistT(10, 0).mInvCdf(0.975), t975, 1e-10 * t975);
  EXPECT_NEAR(qel::CmDistF(1, 10, 0).mInvCdf(0.95), t975 * t975, 1e-10 * t975 * t975);
  EXPECT_TRUE(qel::CmDistF(5, 10, 0).mHasLowerBound());
  const double values[] = {3, 1, 2};
  const double probabilities[] = {0.5, 0.2, 0.3};
  qel::CmDistDiscrete table(values, probabilities, 3);
  EXPECT_EQ(table.mGetLowerBound(), 1.0);
  EXPECT_EQ(table.mGetUpperBound(), 3.0);
  EXPECT_DOUBLE_EQ(table.mCdf(2.0, false), 0.5);
  EXPECT_EQ(table.mInvCdf(0.6), 3.0);
}

TEST(DistributionObjects, DiscreteTableDrawsFitTheirWeights) {
  const std::vector<double> values = {-1, 0.5, 4, 9}, probabilities = {0.1, 0.0, 0.6, 0.3};
  qel::CmDistDiscrete table(values.data(), probabilities.data(), 4);
  qel::CmUniformGenerator g(4.0);
  table.SetBrng(&g);
  std::vector<double> x(100000);
  for (double& v : x) v = table.mGetRandom();
  expectFit(x, values, probabilities);
}

}  // namespace
