// Poisson distribution.
//
// The tails come from the chi-square relation P(X <= k) = Q(2(k + 1), 2 mean):
// the Poisson lower tail is the chi-square upper tail on 2(k + 1) degrees of
// freedom at 2 mean, and each tail is computed in its own right by the ELV
// chi-square routine.
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/discrete_rules.h"
#include "utilities/distributions/gamma_ratio.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/large_parameters.h"
#include "utilities/distributions/saddle_density.h"
#include "utilities/distributions/tail_quantile.h"
#include "utilities/elv/limits.h"
#include "utilities/elv/wrappers.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

double mPoissonPdf(double x, double mean) {
  double k;
  if (!discrete::massPoint(x, &k) || k < 0.0) return 0.0;
  try {
    return saddle::poissonMass(k, mean);
  } catch (const std::runtime_error&) {
    return mGetMissingValueCode();
  } catch (const std::invalid_argument&) {
    return mGetMissingValueCode();
  }
}

namespace {

// Beyond this mean the leading term of Temme's expansion alone gives the
// tails to double precision (the spread 40 sqrt(mean) is below half the
// mean's last place); the chi-square route has no answer there (2 mean may
// even overflow).
constexpr double kHugeMean = 1e40;

// P(X <= k) = Q(k + 1, mean) for a mean beyond kHugeMean by the leading term
// of Temme's uniform expansion, Q(a, x) = erfc(eta sqrt(a/2))/2 with
// eta^2/2 = lambda - 1 - ln lambda, lambda = x/a (DLMF 8.12.3, 8.12.4). The
// first term left out is smaller by eta c0(eta) ~ eta/3 and 1/(3 sqrt(2 pi a)),
// below 1e-18 wherever the tail is above the double range's floor (there
// eta < sqrt(1490/a)). Outside lambda in [1/2, 2] the tail lies below
// e^-(a/10).
void hugeMeanTails(double k, double mean, double* lower, double* upper) {
  const double a = k + 1.0;
  if (a < 0.5 * mean || 0.5 * a > mean) {
    *lower = a < mean ? 0.0 : 1.0;
    *upper = a < mean ? 1.0 : 0.0;
    return;
  }
  const double d = (mean - a) / a;
  const double eta = std::copysign(std::sqrt(2.0 * rlog1(d)), d);
  const double v = eta * std::sqrt(0.5 * a);
  *lower = 0.5 * erfc1(0, v);
  *upper = 0.5 * erfc1(0, -v);
}

// Counts from 2^53 on, where k + 1 and k - 1 round: P(X <= k) = Q(k, mean) +
// m_k and P(X > k) = P(k, mean) - m_k, m_k = mean^k e^-mean / k! (the
// recurrence of the incomplete gamma ratios in the shape, A&S 6.5.21), with
// the shape k itself exact. A tail that gamma_ratio.h does not give is 0 or
// 1 to double precision: such a k lies beyond |1 - mean/k| = 1/4.
void largeCountTails(double k, double mean, double* lower, double* above) {
  double p = 0.0, q = 0.0;
  if (!gammaratio::tails(k, mean, &p, &q)) {
    *lower = k < mean ? 0.0 : 1.0;
    *above = k < mean ? 1.0 : 0.0;
    return;
  }
  const double m = saddle::poissonMass(k, mean);
  *lower = std::fmin(q + m, 1.0);
  *above = std::fmax(p - m, 0.0);
}

constexpr double kExactCountLimit = 0x1p53;

}  // namespace

// The upper tail P(X >= k) is P(X > k - 1).
double mPoissonCdf(double x, double mean, bool upperTail) {
  if (std::isgreaterequal(x, kExactCountLimit) && std::isfinite(mean) && mean > 0.0) {
    // P(X >= k) = P(k, mean); P(X <= k) from the recurrence.
    const double j = upperTail ? discrete::upperPoint(x) : discrete::cdfPoint(x);
    double lower = 0.0, above = 0.0, p = 0.0, q = 0.0;
    if (upperTail) return gammaratio::tails(j, mean, &p, &q) ? p : (j < mean ? 1.0 : 0.0);
    largeCountTails(j, mean, &lower, &above);
    return lower;
  }
  const double k = upperTail ? discrete::upperPoint(x) - 1.0 : discrete::cdfPoint(x);
  if (k < 0.0) return upperTail ? 1.0 : 0.0;
  if (std::isgreater(mean, kHugeMean)) {
    double lower = 0.0, upper = 0.0;
    hugeMeanTails(k, mean, &lower, &upper);
    return upperTail ? upper : lower;
  }
  // 2(k + 1) degrees of freedom beyond the double range: the count lies far
  // above any finite mean's bulk (Chebyshev: mean + sqrt(mean) 1e150).
  if (k > 1e300 && k > 2.0 * mean) return upperTail ? 0.0 : 1.0;
  double chiLower = 0.0, chiUpper = 1.0;
  // P(X <= k) = Q(k + 1, mean).
  if (mean > 0.0 && gammaratio::fastTails(k + 1.0, mean, &chiLower, &chiUpper)) {
    return upperTail ? chiLower : chiUpper;
  }
  if (mean > 0.0 &&
      ElvFailed(elv_chi2_ncdf(2.0 * mean, 2.0 * (k + 1.0), 0.0, &chiLower, &chiUpper))) {
    return mGetMissingValueCode();
  }
  return upperTail ? chiLower : chiUpper;
}

double mPoissonInvCdf(double p, double mean) {
  if (p == 0.0) return 0.0;
  if (p == 1.0) return mGetMissingValueCode();
  if (std::isgreater(mean, elv::kMaxShape) && p > 0.0 && p < 1.0) {
    // Beyond the ELV routine's means: the search on the tails from the
    // Cornish-Fisher start; beyond 2^53 the smallest double at or above the
    // quantile (large_parameters.h).
    const TailPair tails = [mean](double j, double* lower, double* above) {
      if (j >= kExactCountLimit) {
        largeCountTails(j, mean, lower, above);
      } else {
        *lower = mPoissonCdf(j, mean, false);
        *above = mPoissonCdf(j + 1.0, mean, true);
      }
      return !mIsNumericMissing(*lower) && !mIsNumericMissing(*above);
    };
    const double sd = std::sqrt(mean);
    const double start = large::cornishFisherStart(p, mean, sd, 1.0 / sd, 0.0);
    const double q = large::discreteQuantile(tails, p, 0.0, start, sd);
    return std::isnan(q) ? mGetMissingValueCode() : q;
  }
  unsigned long k = 0;
  double fraction = 0.0;
  const bool lowerRoutine = p <= 0.5;
  const ElvStatus status = lowerRoutine ? elv_poisson_lower_quant(p, mean, &k, &fraction)
                                        : elv_poisson_upper_quant(1.0 - p, mean, &k, &fraction);
  if (ElvFailed(status)) {
    // Beyond the routines' range of tails: a search on the smaller tail.
    const TailPair tails = [mean](double j, double* lower, double* above) {
      *lower = mPoissonCdf(j, mean, false);
      *above = mPoissonCdf(j + 1.0, mean, true);
      return !mIsNumericMissing(*lower) && !mIsNumericMissing(*above);
    };
    return mDiscreteTailQuantile(tails, p, 0.0, std::floor(mean), 4.0e9);
  }
  if (k == 0) return 0.0;
  return discrete::correctedQuantile(static_cast<double>(k), fraction, lowerRoutine);
}

}  // namespace qel
