// The P-value of a test statistic from both tails of its distribution.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_PVALUE_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_PVALUE_H

#include <qel/basic_types.h>

#include <cmath>

namespace qel {

// Less: the lower tail; greater: the upper tail; not equal: twice the
// smaller tail (not capped at 1); any other value: 0.0.
inline double mPValueFromTails(double lower, double upper, EAlternative alternative) {
  switch (alternative) {
    case kAlternativeLess:
      return lower;
    case kAlternativeGreater:
      return upper;
    case kAlternativeNotEqual:
      return 2.0 * std::fmin(lower, upper);
    default:
      return 0.0;
  }
}

}  // namespace qel

#endif
