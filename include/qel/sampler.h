/// \file
/// Random sampling for a host: an ISampler owns one seeded uniform stream and
/// fills caller-owned arrays with draws from the distribution families. All
/// operations of one sampler continue the same stream, so a host can seed once
/// and draw many columns; GetSeed names the current position and SetSeed
/// returns to it. A sampler belongs to one thread at a time.
///
/// Each operation returns a message code: 0, or one of the failures of
/// <qel/basic_types.h> (20003 a variate could not be drawn, 30001 out of
/// memory, 30006 a covariance that is not positive definite, 30011 a family
/// the interface names but does not provide).
#ifndef QEL_SAMPLER_H
#define QEL_SAMPLER_H

#include <qel/basic_types.h>
#include <qel/export.h>

namespace qel {

/// A seeded sampler; made by MakeISampler, freed by DeleteISampler. Each
/// drawing operation fills out[0..n-1] and returns a message code; the
/// parameters are those of the family's functions in <qel/distributions.h>.
class ISampler {
 public:
  /// Frees the sampler (hosts call DeleteISampler).
  virtual ~ISampler() {}

  /// A seed names a position of the stream; SetSeed(0) is the fixed state
  /// (1, 1, 1), not a clock seed.
  virtual void SetSeed(double seed) = 0;
  /// The seed that names the current position of the stream.
  virtual double GetSeed() = 0;

  /// Beta(a, b).
  virtual int Beta(double* out, unsigned n, double a, double b) = 0;
  /// Cauchy(location, scale).
  virtual int Cauchy(double* out, unsigned n, double location, double scale) = 0;
  /// The second parameter (a noncentrality) does not enter the draws.
  virtual int ChiSq(double* out, unsigned n, double df, double noncentrality) = 0;
  /// Exponential(scale) shifted by threshold.
  virtual int Exponential(double* out, unsigned n, double scale, double threshold) = 0;
  /// The noncentrality does not enter the draws.
  virtual int F(double* out, unsigned n, double df1, double df2, double noncentrality) = 0;
  /// Gamma(shape, scale) shifted by threshold.
  virtual int Gamma(double* out, unsigned n, double shape, double scale, double threshold) = 0;
  /// Tukey's lambda.
  virtual int Lambda(double* out, unsigned n, double lambda, double location, double scale) = 0;
  /// Laplace(location, scale).
  virtual int Laplace(double* out, unsigned n, double location, double scale) = 0;
  /// Largest extreme value (Gumbel).
  virtual int LargestExtremeValue(double* out, unsigned n, double location, double scale) = 0;
  /// Logistic(location, scale).
  virtual int Logistic(double* out, unsigned n, double location, double scale) = 0;
  /// Log-logistic: log(X - threshold) is Logistic(location, scale).
  virtual int LogLogistic(double* out, unsigned n, double location, double scale,
                          double threshold) = 0;
  /// Log-normal: log(X - threshold) is Normal(location, scale).
  virtual int LogNormal(double* out, unsigned n, double location, double scale,
                        double threshold) = 0;
  /// out[i] receives observation i, dimension values; covariance is the lower
  /// triangle packed by rows.
  virtual int MvNormal(double** out, unsigned n, unsigned dimension, double const* mean,
                       double const* covariance) = 0;
  /// Normal(mean, sigma).
  virtual int Normal(double* out, unsigned n, double mean, double sigma) = 0;
  /// Not provided: 30011, out untouched.
  virtual int Pareto(double* out, unsigned n, double, double) = 0;
  /// Not provided: 30011, out untouched.
  virtual int Rayleigh(double* out, unsigned n, double, double) = 0;
  /// Smallest extreme value.
  virtual int SmallestExtremeValue(double* out, unsigned n, double location, double scale) = 0;
  /// Student's t on df degrees of freedom with a noncentrality.
  virtual int T(double* out, unsigned n, double df, double noncentrality) = 0;
  /// Triangular on [lower, upper] with its peak at mode.
  virtual int Triangular(double* out, unsigned n, double lower, double mode, double upper) = 0;
  /// Uniform on [lower, upper].
  virtual int Uniform(double* out, unsigned n, double lower, double upper) = 0;
  /// Weibull(shape, scale) shifted by threshold.
  virtual int Weibull(double* out, unsigned n, double shape, double scale, double threshold) = 0;
  /// Bernoulli(p): 1 with probability p, else 0.
  virtual int Bernoulli(double* out, unsigned n, double p) = 0;
  /// Binomial(trials, p).
  virtual int Binomial(double* out, unsigned n, int trials, double p) = 0;
  /// Draws values with the given relative weights (equal values merged).
  virtual int Discrete(double* out, unsigned n, double const* values, double const* probabilities,
                       unsigned count) = 0;
  /// countTrials true: trials up to and including the success(es); false:
  /// failures only.
  virtual int Geometric(double* out, unsigned n, double p, bool countTrials) = 0;
  /// Hypergeometric: marked items in a sample from a population.
  virtual int Hypergeometric(double* out, unsigned n, int population, int marked, int sample) = 0;
  /// Negative binomial up to the given number of successes; countTrials as
  /// for Geometric.
  virtual int NegBinomial(double* out, unsigned n, unsigned successes, double p,
                          bool countTrials) = 0;
  /// Poisson(mean).
  virtual int Poisson(double* out, unsigned n, double mean) = 0;
  /// Discrete uniform on the integers lower..upper.
  virtual int Uniform(double* out, unsigned n, int lower, int upper) = 0;
  /// count zero-based indices below population; without replacement they are
  /// distinct (count must not exceed population) and come in draw order.
  virtual int RandomSample(unsigned* out, unsigned population, unsigned count,
                           bool withoutReplacement) = 0;
};

/// A sampler on the generator rng (only kRngCombinedCongruential exists);
/// seed 0 asks for a clock seed. *msgCode: 0; 30011 for rng 0..9, 30017 above
/// 10, 30001 out of memory, with a null result.
QEL_API ISampler* MakeISampler(int* msgCode, double seed, BasicRng rng);
/// Frees *sampler if it is not null, and sets it to null.
QEL_API void DeleteISampler(ISampler** sampler);

}  // namespace qel

#endif
