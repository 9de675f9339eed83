/// \file
/// The chi-square goodness-of-fit test of observed category counts against
/// given proportions, or against equal proportions.
#ifndef QEL_TABULAR_GOF_H
#define QEL_TABULAR_GOF_H

#include <qel/export.h>

namespace qel {

/// One pass over k categories. For category i the expected count is
/// e = proportions[i]*total (total/k when proportions is null), the
/// contribution is d*(d/e) with d = observed[i] - e; statistic is the
/// compensated sum of the contributions, degreesOfFreedom is k - 1 and pValue
/// the upper tail of the chi-square law at the statistic (computed from the
/// upper incomplete gamma function to full relative accuracy down to the
/// underflow threshold).
///
/// Nothing is checked: total is taken as given (it need not be the sum of the
/// counts), proportions need not sum to 1. An expected count of 0 gives an
/// infinite contribution (NaN when the count is 0 too); an infinite
/// statistic has P-value 0 and a NaN statistic a NaN P-value. With k = 0 the
/// statistic is 0, the degrees of freedom -1 and the P-value NaN; with k = 1
/// the P-value is the kernel's answer for 0 degrees of freedom.
///
/// Element i of observed and proportions is read before element i of
/// expected and contributions is written, so an output may be the same array
/// as an input. The result is always 0.
QEL_API int RunLynTabularChiSqGOFTest(double const* observed, double const* proportions,
                                      double* expected, double* contributions, double* statistic,
                                      double* pValue, double* degreesOfFreedom, double total,
                                      unsigned k);

}  // namespace qel

#endif
