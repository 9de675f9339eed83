// Sampler: each family operation builds its distribution object inside the
// floating-point frame, draws one variate per element and reports the
// object's message code. The factory and its inverse are exported.
#include "interfaces/math/sampler.h"

#include <cmath>
#include <limits>
#include <new>
#include <vector>

#include "interfaces/math/random_distributions_v1.h"
#include "interfaces/math/rngs_sampling.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/classes.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace {

// A null array with elements to fill cannot take any draw.
bool cannotFill(const void* out, unsigned n) {
  return out == nullptr && n > 0;
}

// The common form: frame, the object on the stack, its generator, one draw per
// element, the object's code. An exception unwinds through the object.
template <class Dist, class... Args>
int drawInto(CmUniformGenerator* generator, double* out, unsigned n, Args... args) {
  if (cannotFill(out, n)) return qelFailRandomVariate;
  SetLynFpuStates();
  Dist dist(args...);
  dist.SetBrng(generator);
  bool missing = false;
  for (unsigned i = 0; i < n; ++i) {
    out[i] = dist.mGetRandom();
    missing = missing || mIsNumericMissing(out[i]);
  }
  ResetFpuStates();
  // A missing variate is never reported with code 0.
  const int code = dist.GetMsgCode();
  return code == 0 && missing ? qelFailRandomVariate : code;
}

// Parameters outside the family's domain: no draw, NaN in every element and
// the code of a refused argument.
int refuse(double* out, unsigned n) {
  if (out != nullptr) {
    for (unsigned i = 0; i < n; ++i) out[i] = std::numeric_limits<double>::quiet_NaN();
  }
  return qelFailBadEnumValue;
}

bool positiveFinite(double v) {
  return v > 0.0 && std::isfinite(v);
}

// Means from here on are drawn by transformed rejection: the inversion of
// the Poisson quantile needs a tail routine whose work grows with the mean.
constexpr double kLargePoissonMean = 1e8;

// PTRS, the transformed rejection with squeeze of Hormann (1993), "The
// transformed rejection method for generating Poisson random variables",
// Insurance: Mathematics and Economics 12, 39-45; for means of 10 and more.
double poissonByTransformedRejection(CmUniformGenerator* generator, double mean) {
  const double root = std::sqrt(mean);
  const double logMean = std::log(mean);
  const double b = 0.931 + 2.53 * root;
  const double a = -0.059 + 0.02483 * b;
  const double inverseAlpha = 1.1239 + 1.1328 / (b - 3.4);
  const double vr = 0.9277 - 3.6224 / (b - 2.0);
  for (;;) {
    const double u = generator->mGetRandom() - 0.5;
    const double v = generator->mGetRandom();
    const double us = 0.5 - std::fabs(u);
    if (!(us > 0.0 && v > 0.0)) continue;
    const double k = std::floor((2.0 * a / us + b) * u + mean + 0.43);
    if (us >= 0.07 && v <= vr) return k;
    if (k < 0.0 || (us < 0.013 && v > us)) continue;
    if (std::log(v) + std::log(inverseAlpha) - std::log(a / (us * us) + b) <=
        -mean + k * logMean - mLogGamma(k + 1.0)) {
      return k;
    }
  }
}

}  // namespace

Sampler::~Sampler() {
  delete mGenerator;
}

void Sampler::SetSeed(double seed) {
  mGenerator->mSetBase(seed);
}
double Sampler::GetSeed() {
  return mGenerator->mGetBase();
}

int Sampler::Beta(double* out, unsigned n, double a, double b) {
  return drawInto<CmDistBeta>(mGenerator, out, n, a, b);
}
int Sampler::Cauchy(double* out, unsigned n, double location, double scale) {
  return drawInto<CmDistCauchy>(mGenerator, out, n, location, scale);
}
int Sampler::ChiSq(double* out, unsigned n, double df, double) {
  return drawInto<CmDistGamma>(mGenerator, out, n, df * 0.5, 2.0, 0.0);
}
int Sampler::Exponential(double* out, unsigned n, double scale, double threshold) {
  if (!positiveFinite(scale) || !std::isfinite(threshold)) return refuse(out, n);
  return drawInto<CmDistExponential>(mGenerator, out, n, scale, threshold);
}
int Sampler::Gamma(double* out, unsigned n, double shape, double scale, double threshold) {
  return drawInto<CmDistGamma>(mGenerator, out, n, shape, scale, threshold);
}
int Sampler::Lambda(double* out, unsigned n, double lambda, double location, double scale) {
  return drawInto<CmDistLambda>(mGenerator, out, n, lambda, location, scale);
}
int Sampler::Laplace(double* out, unsigned n, double location, double scale) {
  return drawInto<CmDistLaplace>(mGenerator, out, n, location, scale);
}
int Sampler::LargestExtremeValue(double* out, unsigned n, double location, double scale) {
  return drawInto<CmDistLargestExtremeValue>(mGenerator, out, n, location, scale);
}
int Sampler::Logistic(double* out, unsigned n, double location, double scale) {
  return drawInto<CmDistLogistic>(mGenerator, out, n, location, scale);
}
int Sampler::LogLogistic(double* out, unsigned n, double location, double scale, double threshold) {
  return drawInto<CmDistLogLogistic>(mGenerator, out, n, location, scale, threshold);
}
int Sampler::Normal(double* out, unsigned n, double mean, double sigma) {
  return drawInto<CmDistNormal>(mGenerator, out, n, mean, sigma);
}
int Sampler::SmallestExtremeValue(double* out, unsigned n, double location, double scale) {
  return drawInto<CmDistSmallestExtremeValue>(mGenerator, out, n, location, scale);
}
int Sampler::T(double* out, unsigned n, double df, double noncentrality) {
  return drawInto<CmDistT>(mGenerator, out, n, df, noncentrality);
}
int Sampler::Triangular(double* out, unsigned n, double lower, double mode, double upper) {
  return drawInto<CmDistTriangular>(mGenerator, out, n, lower, mode, upper);
}
int Sampler::Uniform(double* out, unsigned n, double lower, double upper) {
  return drawInto<CmDistUniform>(mGenerator, out, n, lower, upper);
}
int Sampler::Bernoulli(double* out, unsigned n, double p) {
  return drawInto<CmDistBernoulli>(mGenerator, out, n, p);
}
int Sampler::Binomial(double* out, unsigned n, int trials, double p) {
  if (trials < 0 || !(p >= 0.0 && p <= 1.0)) return refuse(out, n);
  return drawInto<CmDistBinomial>(mGenerator, out, n, trials, p);
}
// The distribution object's flag says "failures only": the negation.
int Sampler::Geometric(double* out, unsigned n, double p, bool countTrials) {
  return drawInto<CmDistNegBinomial>(mGenerator, out, n, p, 1.0, !countTrials);
}
int Sampler::Hypergeometric(double* out, unsigned n, int population, int marked, int sample) {
  if (marked < 0 || sample < 0 || marked > population || sample > population) {
    return refuse(out, n);
  }
  return drawInto<CmDistHypergeometric>(mGenerator, out, n, population, marked, sample);
}
int Sampler::NegBinomial(double* out, unsigned n, unsigned successes, double p, bool countTrials) {
  return drawInto<CmDistNegBinomial>(mGenerator, out, n, p, static_cast<double>(successes),
                                     !countTrials);
}
int Sampler::Poisson(double* out, unsigned n, double mean) {
  if (!(mean >= 0.0 && std::isfinite(mean))) return refuse(out, n);
  if (mean < kLargePoissonMean) return drawInto<CmDistPoisson>(mGenerator, out, n, mean);
  if (cannotFill(out, n)) return qelFailRandomVariate;
  SetLynFpuStates();
  for (unsigned i = 0; i < n; ++i) out[i] = poissonByTransformedRejection(mGenerator, mean);
  ResetFpuStates();
  return 0;
}
int Sampler::Uniform(double* out, unsigned n, int lower, int upper) {
  return drawInto<CmDistIntegerUniform>(mGenerator, out, n, lower, upper);
}

// F as the odds of a beta draw, the draw held below 1 - eps; the
// noncentrality does not enter.
int Sampler::F(double* out, unsigned n, double df1, double df2, double) {
  if (cannotFill(out, n)) return qelFailRandomVariate;
  SetLynFpuStates();
  CmDistBeta beta(df1 * 0.5, df2 * 0.5);
  beta.SetBrng(mGenerator);
  const double top = 1.0 - mGetEps(false);
  // Bad degrees of freedom leave the beta's missing values as they are; the
  // ratio is formed only when it exists, since the frame traps 1/0.
  const bool valid = df1 > 0.0 && df2 > 0.0;
  const double ratio = valid ? df2 / df1 : 0.0;
  for (unsigned i = 0; i < n; ++i) {
    double x = beta.mGetRandom();
    if (x > top) x = top;
    out[i] = valid ? ratio * (x / (1.0 - x)) : x;
  }
  ResetFpuStates();
  return beta.GetMsgCode();
}

// The normal draws are made in order first, so that the stream does not
// depend on the number of threads; only the transformation is parallel.
int Sampler::LogNormal(double* out, unsigned n, double location, double scale, double threshold) {
  if (cannotFill(out, n)) return qelFailRandomVariate;
  SetLynFpuStates();
  CmDistNormal normal(location, scale);
  normal.SetBrng(mGenerator);
  for (unsigned i = 0; i < n; ++i) out[i] = normal.mGetRandom();
  ResetFpuStates();
  const long count = static_cast<long>(n);
#pragma omp parallel for schedule(static)
  for (long i = 0; i < count; ++i) out[i] = std::exp(out[i]) + threshold;
  return normal.GetMsgCode();
}

int Sampler::MvNormal(double** out, unsigned n, unsigned dimension, double const* mean,
                      double const* covariance) {
  if (cannotFill(out, n)) return qelFailRandomVariate;
  SetLynFpuStates();
  CmDistMVNormal mvn(mean, covariance, dimension);
  if (mvn.GetMsgCode() != 0) {
    ResetFpuStates();
    return mvn.GetMsgCode();
  }
  mvn.SetBrng(mGenerator);
  std::vector<double> draw;
  for (unsigned i = 0; i < n; ++i) {
    mvn.mGetRandom(draw);
    for (unsigned j = 0; j < dimension; ++j) out[i][j] = draw[j];
  }
  ResetFpuStates();
  return mvn.GetMsgCode();
}

// No object and no frame: the quantile of each uniform. Always 0.
int Sampler::Weibull(double* out, unsigned n, double shape, double scale, double threshold) {
  if (cannotFill(out, n)) return qelFailRandomVariate;
  for (unsigned i = 0; i < n; ++i)
    out[i] = v1::WeibullInvCdf(mGenerator->mGetRandom(), shape, scale, threshold);
  return 0;
}

int Sampler::Pareto(double*, unsigned, double, double) {
  return qelFailNotImplemented;
}
int Sampler::Rayleigh(double*, unsigned, double, double) {
  return qelFailNotImplemented;
}

// The table in canonical form, then Vose's alias method on it. An empty table,
// or one without usable weights, has nothing to draw from.
int Sampler::Discrete(double* out, unsigned n, double const* values, double const* probabilities,
                      unsigned count) {
  if (cannotFill(out, n) || count == 0 || values == nullptr || probabilities == nullptr)
    return qelFailRandomVariate;
  const double* mergedValues = values;
  const double* mergedProbabilities = probabilities;
  unsigned merged = count;
  if (v1::CreatePseudoPmf(&mergedValues, &mergedProbabilities, &merged) != 0)
    return qelFailOutOfMemory;
  // Weights must be relative frequencies: none negative or NaN, a positive
  // finite sum. Otherwise the table's thresholds would be NaN, which the
  // armed frame traps at the first comparison.
  double sum = 0.0;
  bool usable = true;
  for (unsigned k = 0; k < merged; ++k) {
    usable = usable && mergedProbabilities[k] >= 0.0;
    sum += mergedProbabilities[k];
  }
  if (!usable || !(sum > 0.0 && sum <= std::numeric_limits<double>::max())) {
    delete[] mergedValues;
    delete[] mergedProbabilities;
    return qelFailRandomVariate;
  }
  v1::SamplingWithReplace alias(mergedProbabilities, merged);
  SetLynFpuStates();
  if (alias.GetMsgCode() == 0) {
    alias.SetBrng(mGenerator);
    for (unsigned i = 0; i < n; ++i) out[i] = mergedValues[alias.GetValue()];
  }
  delete[] mergedValues;
  delete[] mergedProbabilities;
  ResetFpuStates();
  return alias.GetMsgCode();
}

// Zero-based indices below population. Without replacement a partial
// Fisher-Yates draw: the chosen index leaves the pool and the last remaining
// one takes its place.
int Sampler::RandomSample(unsigned* out, unsigned population, unsigned count,
                          bool withoutReplacement) {
  if (cannotFill(out, count)) return qelFailRandomVariate;
  // Without replacement no more than the population can be drawn.
  if (withoutReplacement && count > population) {
    for (unsigned i = 0; i < count; ++i) out[i] = 4294967295u;
    return qelFailBadEnumValue;
  }
  if (!withoutReplacement) {
    for (unsigned i = 0; i < count; ++i)
      out[i] = static_cast<unsigned>(std::floor(mGenerator->mGetRandom() * population));
    return 0;
  }
  unsigned* pool = new (std::nothrow) unsigned[population];
  if (pool == nullptr) {
    for (unsigned i = 0; i < count; ++i) out[i] = 4294967295u;
    return qelFailOutOfMemory;
  }
  for (unsigned i = 0; i < population; ++i) pool[i] = i;
  for (unsigned i = 0; i < count && i < population; ++i) {
    const unsigned remaining = population - i;
    const auto j = static_cast<unsigned>(std::floor(mGenerator->mGetRandom() * remaining));
    out[i] = pool[j];
    pool[j] = pool[remaining - 1];
  }
  delete[] pool;
  return 0;
}

ISampler* MakeISampler(int* msgCode, double seed, BasicRng rng) {
  SetLynFpuStates();
  ISampler* result = nullptr;
  if (rng != kRngCombinedCongruential) {
    *msgCode = rng <= 9 ? qelFailNotImplemented : qelFailUnknownSelector;
  } else {
    CmUniformGenerator* generator = nullptr;
    try {
      generator = new CmUniformGenerator(seed);
      result = new Sampler(generator);
      *msgCode = 0;
    } catch (const std::bad_alloc&) {
      delete generator;
      *msgCode = qelFailOutOfMemory;
    }
  }
  ResetFpuStates();
  return result;
}

void DeleteISampler(ISampler** sampler) {
  if (*sampler != nullptr) delete *sampler;
  *sampler = nullptr;
}

}  // namespace qel
