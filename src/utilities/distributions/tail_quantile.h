// Quantiles of a continuous law from its smaller tail, solved in logarithms,
// so that p = 1e-300 and 1 - p = 1e-300 keep their digits.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_TAIL_QUANTILE_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_TAIL_QUANTILE_H

#include <cmath>
#include <functional>

namespace qel {

// Both tails at x; false when they are not available.
using TailPair = std::function<bool(double x, double* lower, double* upper)>;

enum class TailSupport {
  Positive,  // (0, inf)
  Unit,      // (0, 1)
  RealLine,  // (-inf, inf)
};

// x with P(X <= x) = p for 0 < p < 1, solved on the smaller tail: the lower
// tail for p at most 1/2, the upper tail against 1 - p otherwise. start is a
// point of the support near the answer. The missing value when the tails
// fail or no bracket is found. firstStep is the first bracketing step in the
// coordinate of the support (log x, logit x or asinh x): small when start is
// already close, as for the polishing of a quantile to the last digit.
// True when every shape is a positive number. The comparison is the quiet
// one: a NaN shape must not raise the invalid operation in an armed thread
// before the searches, whose arithmetic on such a shape would.
inline bool mPositiveShapes(double a, double b = 1.0) {
  return std::isgreater(a, 0.0) && std::isgreater(b, 0.0);
}

double mTailQuantile(const TailPair& tails, double p, TailSupport support, double start,
                     double firstStep = 1.0);

// Smallest integer k from lo on with P(X <= k) >= p, 0 < p < 1, decided on
// the smaller tail: tails(k) gives P(X <= k) and P(X > k). The search
// doubles its upper end from start (at most last) and then bisects. The
// missing value when the tails fail or no such k is found.
double mDiscreteTailQuantile(const TailPair& tails, double p, double lo, double start, double last);

// A quantile q from a routine accurate to about 1e-10, polished to the last
// digit on the smaller tail (at the full ELV precision only; the historical
// setting keeps q as it stands).
double mPolishedQuantile(const TailPair& tails, double p, TailSupport support, double q);

}  // namespace qel

#endif
