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
#include "utilities/distributions/saddle_density.h"
#include "utilities/distributions/tail_quantile.h"
#include "utilities/elv/wrappers.h"
#include "utilities/special_functions/transcendental.h"

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

// The upper tail P(X >= k) is P(X > k - 1).
double mPoissonCdf(double x, double mean, bool upperTail) {
  const double k = upperTail ? discrete::upperPoint(x) - 1.0 : discrete::cdfPoint(x);
  if (k < 0.0) return upperTail ? 1.0 : 0.0;
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
