#include "interfaces/math/random_distributions_v1.h"

#include <algorithm>
#include <cmath>
#include <limits>

#include "interfaces/math/transcendental_v1.h"
#include "utilities/elv/wrappers.h"
#include "utilities/higher_functions/incomplete_beta.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"

namespace qel {
namespace v1 {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

// The quantile routines of the discrete ELV families answer k and a fraction;
// a fraction met only within rounding lowers k by one (not below 0).
constexpr double kLowerFractionLimit = 1e-9;
constexpr double kUpperFractionLimit = 0.999999999;

bool isAlmostInteger(double x) {
  return TheseAreAlmostEqual(x, NearestInteger(x));
}

// The integer a cumulative function works at: an almost integer x rounded,
// any other x taken to its floor.
double cumulativeIndex(double x) {
  return isAlmostInteger(x) ? NearestInteger(x) : std::floor(x);
}

// The P-value for an alternative from a pair of tails.
double pValueFromTails(double lower, double upper, AlternativeHypothesis alternative) {
  switch (alternative) {
    case kAlternativeLess:
      return lower;
    case kAlternativeGreater:
      return upper;
    case kAlternativeNotEqual:
      return 2.0 * std::min(lower, upper);
    default:
      return -2.0;
  }
}

// k corrected by the fraction of the lower (p <= 0.5) or upper quantile routine.
double correctedQuantile(unsigned long k, double fraction, bool fromLowerRoutine) {
  const bool lower =
      fromLowerRoutine ? fraction <= kLowerFractionLimit : fraction >= kUpperFractionLimit;
  return (lower && k > 0) ? static_cast<double>(k - 1) : static_cast<double>(k);
}

template <class Scalar, class... Params>
void elementwise(Scalar scalar, double* out, const double* in, unsigned count, Params... params) {
  for (unsigned i = 0; i < count; ++i) out[i] = scalar(in[i], params...);
}

}  // namespace

double NormalCdf(double x, double mean, double sigma, bool upperTail) {
  if (std::isnan(x)) return kNaN;
  if (x == mean && sigma > 0.0) return 0.5;
  double lower, upper;
  if (ElvFailed(elv_normal_df((x - mean) / sigma, &lower, &upper))) return kNaN;
  return upperTail ? upper : lower;
}

double NormalInvCdf(double p, double mean, double sigma) {
  double z;
  if (ElvFailed(elv_inv_normal_df(p, &z))) return kNaN;
  return mean + sigma * z;
}

double NormalPValue(double z, AlternativeHypothesis alternative) {
  if (!std::isfinite(z)) return kNaN;
  double lower = 0.5, upper = 0.5;
  if (z != 0.0 && ElvFailed(elv_normal_df(z, &lower, &upper))) return kNaN;
  return pValueFromTails(lower, upper, alternative);
}

double ChiSqPValue(double x, double df, AlternativeHypothesis alternative) {
  if (!std::isfinite(x)) return kNaN;
  double lower = 0.0, upper = 1.0;
  if (x > 0.0 && ElvFailed(elv_chi2_ncdf(x, df, 0.0, &lower, &upper))) return kNaN;
  return pValueFromTails(lower, upper, alternative);
}

double BetaPdf(double x, double a, double b) {
  if (x < 0.0 || x > 1.0) return 0.0;
  if (x == 0.0) return a < 1.0 ? kNaN : (a == 1.0 ? b : 0.0);
  if (x == 1.0) return b < 1.0 ? kNaN : (b == 1.0 ? a : 0.0);
  return std::exp((a - 1.0) * std::log(x) + (b - 1.0) * std::log1p(-x) - LogGamma(a) - LogGamma(b) +
                  LogGamma(a + b));
}

double BetaCdf(double x, double a, double b, bool upperTail) {
  if (x <= 0.0) return upperTail ? 1.0 : 0.0;
  if (x >= 1.0) return upperTail ? 0.0 : 1.0;
  double lower, upper, density;
  if (ElvFailed(elv_beta_df(x, a, b, &lower, &upper, &density))) return kNaN;
  return upperTail ? upper : lower;
}

double BetaInvCdf(double p, double a, double b) {
  if (!(p >= 0.0 && p <= 1.0)) return kNaN;
  if (p == 0.0) return 0.0;
  if (p == 1.0) return 1.0;
  double q;
  const ElvStatus status =
      p > 0.5 ? elv_beta_upper_quant(1.0 - p, a, b, &q) : elv_beta_lower_quant(p, a, b, &q);
  return ElvFailed(status) ? kNaN : q;
}

double BinomialPdf(double x, unsigned n, double p) {
  if (!isAlmostInteger(x)) return 0.0;
  x = NearestInteger(x);
  if (x < 0.0 || x > n) return 0.0;
  if ((x == 0.0 && p == 0.0) || (x == n && p == 1.0)) return 1.0;
  const unsigned k = static_cast<unsigned>(x);
  return std::exp(LogNChooseK(n, k) + x * std::log(p) + (n - x) * std::log1p(-p));
}

double BinomialCdf(double x, unsigned n, double p, bool upperTail) {
  // The upper tail is asked as P(n - X <= n - x) under 1 - p, so that it
  // includes the point x.
  if (upperTail) {
    p = 1.0 - p;
    x = n - x;
  }
  const double k = cumulativeIndex(x);
  if (k >= n) return 1.0;
  if (k < 0.0) return 0.0;
  double lower, upper, mass;
  if (!ElvFailed(elv_binomial_df(static_cast<unsigned long>(k), n, p, &lower, &upper, &mass))) {
    return lower;
  }
  return mIncompleteBetaRatio(p, 1.0 - p, k + 1.0, n - k, true);
}

double BinomialInvCdf(double p, unsigned n, double prob) {
  if (p == 0.0) return 0.0;
  if (p == 1.0) return n;
  unsigned long k;
  double fraction;
  const bool lowerRoutine = p <= 0.5;
  const ElvStatus status = lowerRoutine ? elv_binomial_lower_quant(p, n, prob, &k, &fraction)
                                        : elv_binomial_upper_quant(1.0 - p, n, prob, &k, &fraction);
  if (ElvFailed(status)) return kNaN;
  return correctedQuantile(k, fraction, lowerRoutine);
}

double HypergeometricPdf(double x, unsigned N, unsigned M, unsigned n) {
  if (!isAlmostInteger(x)) return 0.0;
  x = NearestInteger(x);
  if (x < 0.0 || x > std::min(M, n) || static_cast<double>(N) + x < static_cast<double>(M) + n) {
    return 0.0;
  }
  const unsigned k = static_cast<unsigned>(x);
  return std::exp(LogNChooseK(M, k) + LogNChooseK(N - M, n - k) - LogNChooseK(N, n));
}

double HypergeometricCdf(double x, unsigned N, unsigned M, unsigned n, bool upperTail) {
  const double k = cumulativeIndex(x);
  if (static_cast<double>(M) + n > static_cast<double>(N) + k) return upperTail ? 1.0 : 0.0;
  if (k > std::min(M, n)) return upperTail ? 0.0 : 1.0;
  double lower, above, mass;
  if (ElvFailed(elv_hypergeo_df(static_cast<unsigned long>(k), N, M, n, &lower, &above, &mass))) {
    return kNaN;
  }
  // The upper tail counts the point: P(X > k) + P(X = k).
  return upperTail ? above + mass : lower;
}

bool HypergeometricInvCdfHelpFailed(unsigned N, unsigned M, unsigned n, double* result) {
  if (N == M) {
    *result = n;
  } else if (M == 0) {
    *result = 0.0;
  } else if (N == n) {
    *result = M;
  } else if (n == 0) {
    *result = 0.0;
  } else {
    return false;
  }
  return true;
}

double HypergeometricInvCdfHelpLoop(double p, unsigned N, unsigned M, unsigned n) {
  if (p == 0.0) return std::max(static_cast<double>(M) + n - N, 0.0);
  if (p >= 1.0) return std::min(M, n);
  unsigned long k;
  double fraction;
  const bool lowerRoutine = p <= 0.5;
  const ElvStatus status = lowerRoutine ? elv_hypergeo_lower_quant(p, N, M, n, &k, &fraction)
                                        : elv_hypergeo_upper_quant(1.0 - p, N, M, n, &k, &fraction);
  if (ElvFailed(status)) return kNaN;
  return correctedQuantile(k, fraction, lowerRoutine);
}

double HypergeometricInvCdf(double p, unsigned N, unsigned M, unsigned n) {
  double result;
  if (HypergeometricInvCdfHelpFailed(N, M, n, &result)) return result;
  return HypergeometricInvCdfHelpLoop(p, N, M, n);
}

double HypergeometricPValue(unsigned x, unsigned N, unsigned M, unsigned n,
                            AlternativeHypothesis alternative) {
  if (alternative == kAlternativeLess) return HypergeometricCdf(x, N, M, n, false);
  if (alternative == kAlternativeGreater) return HypergeometricCdf(x, N, M, n, true);
  if (alternative != kAlternativeNotEqual) return kNaN;
  // Fisher's exact test: the outcomes on the far side of the mode that are
  // no more probable than x join x's own tail.
  const unsigned lo = M + n > N ? M + n - N : 0;
  const unsigned hi = std::min(M, n);
  unsigned mode = static_cast<unsigned>(std::floor((M + 1.0) * (n + 1.0) / (N + 2.0)));
  if (mode > lo && HypergeometricPdf(mode - 1, N, M, n) > HypergeometricPdf(mode, N, M, n)) {
    --mode;
  } else if (mode < hi && HypergeometricPdf(mode + 1, N, M, n) > HypergeometricPdf(mode, N, M, n)) {
    ++mode;
  }
  if (x == mode) return 1.0;
  const double atX = HypergeometricPdf(x, N, M, n);
  const double eps = mGetEps(false);
  auto noMoreProbable = [&](unsigned y) {
    const double atY = HypergeometricPdf(y, N, M, n);
    return atY <= atX || mApproxEqual(atY, atX, eps, 0.0);
  };
  double sum;
  if (x < mode) {
    sum = HypergeometricCdf(x, N, M, n, false);
    for (unsigned y = hi; y > mode && noMoreProbable(y); --y) sum += HypergeometricPdf(y, N, M, n);
  } else {
    sum = HypergeometricCdf(x, N, M, n, true);
    for (unsigned y = lo; y < mode && noMoreProbable(y); ++y) sum += HypergeometricPdf(y, N, M, n);
  }
  return sum;
}

double WeibullInvCdf(double p, double shape, double scale, double threshold) {
  if (p == 0.0) return threshold;
  if (p == 1.0) return std::numeric_limits<double>::infinity();
  if (!(p > 0.0 && p < 1.0)) return kNaN;
  return threshold + scale * std::pow(-std::log1p(-p), 1.0 / shape);
}

void NormalCdf(double* out, const double* x, unsigned count, double mean, double sigma,
               bool upperTail) {
  elementwise(static_cast<double (*)(double, double, double, bool)>(NormalCdf), out, x, count, mean,
              sigma, upperTail);
}
void NormalInvCdf(double* out, const double* p, unsigned count, double mean, double sigma) {
  elementwise(static_cast<double (*)(double, double, double)>(NormalInvCdf), out, p, count, mean,
              sigma);
}
void BetaPdf(double* out, const double* x, unsigned count, double a, double b) {
  elementwise(static_cast<double (*)(double, double, double)>(BetaPdf), out, x, count, a, b);
}
void BetaCdf(double* out, const double* x, unsigned count, double a, double b, bool upperTail) {
  elementwise(static_cast<double (*)(double, double, double, bool)>(BetaCdf), out, x, count, a, b,
              upperTail);
}
void BetaInvCdf(double* out, const double* p, unsigned count, double a, double b) {
  elementwise(static_cast<double (*)(double, double, double)>(BetaInvCdf), out, p, count, a, b);
}
void BinomialPdf(double* out, const double* x, unsigned count, unsigned n, double p) {
  elementwise(static_cast<double (*)(double, unsigned, double)>(BinomialPdf), out, x, count, n, p);
}
void BinomialCdf(double* out, const double* x, unsigned count, unsigned n, double p,
                 bool upperTail) {
  elementwise(static_cast<double (*)(double, unsigned, double, bool)>(BinomialCdf), out, x, count,
              n, p, upperTail);
}
void BinomialInvCdf(double* out, const double* p, unsigned count, unsigned n, double prob) {
  elementwise(static_cast<double (*)(double, unsigned, double)>(BinomialInvCdf), out, p, count, n,
              prob);
}
void HypergeometricPdf(double* out, const double* x, unsigned count, unsigned N, unsigned M,
                       unsigned n) {
  elementwise(static_cast<double (*)(double, unsigned, unsigned, unsigned)>(HypergeometricPdf), out,
              x, count, N, M, n);
}
void HypergeometricCdf(double* out, const double* x, unsigned count, unsigned N, unsigned M,
                       unsigned n, bool upperTail) {
  elementwise(
      static_cast<double (*)(double, unsigned, unsigned, unsigned, bool)>(HypergeometricCdf), out,
      x, count, N, M, n, upperTail);
}
void HypergeometricInvCdf(double* out, const double* p, unsigned count, unsigned N, unsigned M,
                          unsigned n) {
  elementwise(static_cast<double (*)(double, unsigned, unsigned, unsigned)>(HypergeometricInvCdf),
              out, p, count, N, M, n);
}
void WeibullInvCdf(double* out, const double* p, unsigned count, double shape, double scale,
                   double threshold) {
  elementwise(static_cast<double (*)(double, double, double, double)>(WeibullInvCdf), out, p, count,
              shape, scale, threshold);
}

}  // namespace v1
}  // namespace qel
