// Helpers shared by the one- and two-proportion intervals and tests.
#ifndef QEL_SRC_INTERFACES_BASIC_STATISTICS_PROPORTIONS_H
#define QEL_SRC_INTERFACES_BASIC_STATISTICS_PROPORTIONS_H

#include <qel/basic_types.h>

namespace qel {
namespace v0 {

// sqrt(v), or NaN for a negative or NaN v without calling the C library
// (a negative variance comes from events > trials or p0 outside [0, 1]).
double RootOrNaN(double v);

// Normal P-value of a z statistic. An infinite z (p0 of 0 or 1, or a zero
// variance) gets the limit of each tail: 0 or 1 on one side, 0 two-sided.
// NaN for an alternative outside -1, 0, 1 (the z tests return no code).
double ZPValue(double z, AlternativeHypothesis alternative);

// Wald-type interval estimate -/+ q * standardError with q the normal
// quantile of the interval type.
int NormalInterval(double confidence, IntervalType type, double estimate, double standardError,
                   double* lower, double* upper);

// The two-sided normal quantile at (1 + confidence) / 2.
double TwoSidedZ(double confidence);

}  // namespace v0
}  // namespace qel

#endif
