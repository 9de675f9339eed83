// The one implementation of ISampler: it owns a CmUniformGenerator and, for
// each call, builds the family's distribution object, lends it the generator
// and fills the array with its draws.
#ifndef QEL_SRC_INTERFACES_MATH_SAMPLER_H
#define QEL_SRC_INTERFACES_MATH_SAMPLER_H

#include <qel/sampler.h>

#include "interfaces/math/rngs.h"

namespace qel {

class Sampler : public ISampler {
 public:
  // Takes ownership of generator.
  explicit Sampler(CmUniformGenerator* generator) : mGenerator(generator) {}
  Sampler(const Sampler&) = delete;
  Sampler& operator=(const Sampler&) = delete;
  ~Sampler() override;

  void SetSeed(double seed) override;
  double GetSeed() override;
  int Beta(double* out, unsigned n, double a, double b) override;
  int Cauchy(double* out, unsigned n, double location, double scale) override;
  int ChiSq(double* out, unsigned n, double df, double noncentrality) override;
  int Exponential(double* out, unsigned n, double scale, double threshold) override;
  int F(double* out, unsigned n, double df1, double df2, double noncentrality) override;
  int Gamma(double* out, unsigned n, double shape, double scale, double threshold) override;
  int Lambda(double* out, unsigned n, double lambda, double location, double scale) override;
  int Laplace(double* out, unsigned n, double location, double scale) override;
  int LargestExtremeValue(double* out, unsigned n, double location, double scale) override;
  int Logistic(double* out, unsigned n, double location, double scale) override;
  int LogLogistic(double* out, unsigned n, double location, double scale,
                  double threshold) override;
  int LogNormal(double* out, unsigned n, double location, double scale, double threshold) override;
  int MvNormal(double** out, unsigned n, unsigned dimension, double const* mean,
               double const* covariance) override;
  int Normal(double* out, unsigned n, double mean, double sigma) override;
  int Pareto(double* out, unsigned n, double, double) override;
  int Rayleigh(double* out, unsigned n, double, double) override;
  int SmallestExtremeValue(double* out, unsigned n, double location, double scale) override;
  int T(double* out, unsigned n, double df, double noncentrality) override;
  int Triangular(double* out, unsigned n, double lower, double mode, double upper) override;
  int Uniform(double* out, unsigned n, double lower, double upper) override;
  int Weibull(double* out, unsigned n, double shape, double scale, double threshold) override;
  int Bernoulli(double* out, unsigned n, double p) override;
  int Binomial(double* out, unsigned n, int trials, double p) override;
  int Discrete(double* out, unsigned n, double const* values, double const* probabilities,
               unsigned count) override;
  int Geometric(double* out, unsigned n, double p, bool countTrials) override;
  int Hypergeometric(double* out, unsigned n, int population, int marked, int sample) override;
  int NegBinomial(double* out, unsigned n, unsigned successes, double p, bool countTrials) override;
  int Poisson(double* out, unsigned n, double mean) override;
  int Uniform(double* out, unsigned n, int lower, int upper) override;
  int RandomSample(unsigned* out, unsigned population, unsigned count,
                   bool withoutReplacement) override;

 private:
  CmUniformGenerator* mGenerator;
};

}  // namespace qel

#endif
