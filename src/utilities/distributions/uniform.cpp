// Continuous uniform distribution on [lower, upper].
#include "utilities/distributions/kernels.h"

namespace qel {

double mUniformPdf(double x, double lower, double upper) {
  if (x < lower || x > upper) return 0.0;
  return 1.0 / (upper - lower);
}

double mUniformCdf(double x, double lower, double upper, bool upperTail) {
  if (x <= lower) return upperTail ? 1.0 : 0.0;
  if (x >= upper) return upperTail ? 0.0 : 1.0;
  // Each tail from its own difference, so that neither is 1 minus the other.
  return upperTail ? (upper - x) / (upper - lower) : (x - lower) / (upper - lower);
}

double mUniformInvCdf(double p, double lower, double upper) {
  // The ends are returned exactly rather than through the formula.
  if (p == 0.0) return lower;
  if (p == 1.0) return upper;
  return lower + p * (upper - lower);
}

}  // namespace qel
