// Parameter domains of the exported distribution families, and the answers
// that hold for every family at the ends of the real line.
//
// An exported function checks its parameters once, before the kernel runs:
// a parameter outside its family's domain (a scale that is not positive, a
// probability outside [0, 1], a count that is not a whole number, NaN, an
// infinity or the missing value) gives NaN, and the kernel is never reached.
// The predicates below are the vocabulary of the family table in
// tools/codegen/gen_distribution_api.py, which writes each family's check.
#ifndef QEL_SRC_INTERFACES_MATH_DOMAINS_H
#define QEL_SRC_INTERFACES_MATH_DOMAINS_H

#include <cfloat>
#include <cmath>

#include "utilities/LYNBasicTypes.h"

namespace qel {
namespace domain {

// A finite number that is not the missing value.
inline bool finite(double v) {
  return std::isfinite(v) && !mIsNumericMissing(v);
}

// Positive and normal: the armed state reads a denormal operand as zero, so
// a denormal scale or df would be a zero to the kernel.
inline bool positive(double v) {
  return finite(v) && v >= DBL_MIN;
}

inline bool nonNegative(double v) {
  return finite(v) && v >= 0.0;
}

inline bool probability(double v) {
  return v >= 0.0 && v <= 1.0;
}

// A whole number of trials held in a double: exact up to 2^53.
inline bool count(double v) {
  return v >= 0.0 && v <= 9007199254740992.0 && v == std::floor(v);
}

// The kind of an exported function decides its answer at the ends of the
// real line, which is the same for every family: no kernel sees an
// infinite or NaN argument.
enum class Kind { kPdf, kCdf, kInvCdf };

// True when the first argument decides the answer alone; *answer holds it.
inline bool decidedByArgument(Kind kind, double x, bool upperTail, double* answer) {
  if (std::isnan(x) || mIsNumericMissing(x)) {
    *answer = mQuietNaN();
    return true;
  }
  if (kind == Kind::kInvCdf) {
    // A denormal p is a zero of its sign, as the armed state reads it, so
    // that scalar and array forms decide alike.
    if (std::fpclassify(x) == FP_SUBNORMAL) x = std::copysign(0.0, x);
    if (x >= 0.0 && x <= 1.0) return false;
    *answer = mQuietNaN();
    return true;
  }
  if (!std::isinf(x)) return false;
  if (kind == Kind::kPdf) {
    *answer = 0.0;
  } else {
    // P(X <= -inf) = 0 and P(X >= -inf) = 1; at +inf the reverse.
    *answer = (x > 0.0) != upperTail ? 1.0 : 0.0;
  }
  return true;
}

// A P-value at a NaN, missing or infinite statistic. At an infinite one the
// lower tail is 0 or 1 and the two-sided value is 0; an alternative outside
// the three enumerators is left to the kernel's own rule.
inline bool decidedStatistic(double x, EAlternative alternative, double* answer) {
  if (std::isnan(x) || mIsNumericMissing(x)) {
    *answer = mQuietNaN();
    return true;
  }
  if (!std::isinf(x)) return false;
  const double lower = x > 0.0 ? 1.0 : 0.0;
  if (alternative == kAlternativeLess) {
    *answer = lower;
  } else if (alternative == kAlternativeGreater) {
    *answer = 1.0 - lower;
  } else if (alternative == kAlternativeNotEqual) {
    *answer = 0.0;
  } else {
    *answer = mQuietNaN();
  }
  return true;
}

// A critical value at a level outside [0, 1] (or NaN) does not exist.
inline bool decidedLevel(double alpha, double* answer) {
  if (alpha >= 0.0 && alpha <= 1.0) return false;
  *answer = mQuietNaN();
  return true;
}

}  // namespace domain
}  // namespace qel

#endif
