#include "interfaces/math/random_distributions_v0.h"

#include <cmath>

#include "interfaces/math/frames.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"

namespace qel {
namespace v0 {

namespace {

bool notFinite(double x) {
  return !std::isfinite(x);
}

// p of the critical value: 1 - alpha one-sided, 1 - alpha/2 two-sided, and 0
// for a value that names no alternative.
double criticalProbability(double alpha, AlternativeHypothesis alternative) {
  if (alternative == kAlternativeLess || alternative == kAlternativeGreater) return 1.0 - alpha;
  if (alternative == kAlternativeNotEqual) return 1.0 - alpha / 2.0;
  return 0.0;
}

}  // namespace

double NormalInvCdf(double p, double mean, double sigma) {
  if (notFinite(p)) return mQuietNaN();
  return frame::armed(mNormalInvCdf, p, mean, sigma);
}

double TInvCdf(double p, double df, double noncentrality) {
  if (notFinite(p) || notFinite(df) || !(df > 0.0)) return mQuietNaN();
  return frame::armed(mTInvCdf, p, df, noncentrality);
}

double NormalPValue(double z, AlternativeHypothesis alternative) {
  if (std::isnan(z)) return mQuietNaN();
  if (std::isinf(z)) return 0.0;
  return frame::armed(mNormalPValue, z, alternative);
}

double TPValue(double t, double df, AlternativeHypothesis alternative) {
  // No degrees of freedom (a sample of one): no P-value.
  if (std::isnan(t) || std::isnan(df) || !(df > 0.0)) return mQuietNaN();
  if (std::isinf(t)) return 0.0;
  // Infinitely many degrees of freedom: the normal law.
  if (std::isinf(df)) return frame::armed(mNormalPValue, t, alternative);
  return frame::armed(mTPValue, t, df, alternative);
}

double NormalCritValue(double alpha, AlternativeHypothesis alternative) {
  const double p = criticalProbability(alpha, alternative);
  if (notFinite(p)) return mQuietNaN();
  return frame::armed(mNormalInvCdf, p, 0.0, 1.0);
}

double TCritValue(double alpha, double df, AlternativeHypothesis alternative) {
  if (notFinite(alpha) || notFinite(df) || !(df > 0.0)) return mQuietNaN();
  return frame::armed(mTInvCdf, criticalProbability(alpha, alternative), df, 0.0);
}

double BinomialPValue(double x, unsigned n, double p, AlternativeHypothesis alternative) {
  return frame::armed(mBinomialPValue, x, static_cast<int>(n), p, alternative);
}

double NormalInvCdfFunc::operator()(double p) const {
  return NormalInvCdf(p, 0.0, 1.0);
}

double TInvCdfFunc::operator()(double p) const {
  return TInvCdf(p, mDf, 0.0);
}

}  // namespace v0
}  // namespace qel
