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
#include "utilities/distributions/kernels.h"
#include "utilities/elv/wrappers.h"
#include "utilities/special_functions/transcendental.h"

namespace qel {

double mPoissonPdf(double x, double mean) {
  double k;
  if (!discrete::massPoint(x, &k) || k < 0.0) return 0.0;
  try {
    return mExponential(-mean + k * mLog(mean, true) - mLogGamma(k + 1.0), true);
  } catch (const std::runtime_error&) {
    return 0.0;
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
  if (ElvFailed(status)) return mGetMissingValueCode();
  if (k == 0) return 0.0;
  return discrete::correctedQuantile(static_cast<double>(k), fraction, lowerRoutine);
}

}  // namespace qel
