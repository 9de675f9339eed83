// Inner side of the location tests: the symmetric interval maker and the
// helpers that the Run forms share.
#ifndef QEL_SRC_INTERFACES_BASIC_STATISTICS_INTERVAL_H
#define QEL_SRC_INTERFACES_BASIC_STATISTICS_INTERVAL_H

#include <qel/basic_types.h>
#include <qel/location_tests.h>

#include "interfaces/math/random_distributions_v0.h"

namespace qel {
namespace v1 {

// Confidence interval estimate -/+ standardError * q, with q the quantile of
// the statistic's law given by inverseCdf. A one-sided interval puts the
// whole confidence level in its one tail and leaves the other limit infinite.
// Returns 0 (whatever NaN the quantile carries into the limits), or 30002
// with both limits NaN for a type outside -1, 0, 1.
template <class F>
int MakeTraditionalSymmetricCI(F const& inverseCdf, double confidence, IntervalType type,
                               double estimate, double standardError, double* lower, double* upper);

extern template int MakeTraditionalSymmetricCI<v0::NormalInvCdfFunc>(v0::NormalInvCdfFunc const&,
                                                                     double, IntervalType, double,
                                                                     double, double*, double*);
extern template int MakeTraditionalSymmetricCI<v0::TInvCdfFunc>(v0::TInvCdfFunc const&, double,
                                                                IntervalType, double, double,
                                                                double*, double*);

}  // namespace v1

namespace v0 {

// Per-column means, deviations and standard errors of a paired sample.
void RunPairedTHelper(PairedT& record, double const* x, double const* y);
// Mean and deviation of the differences x[i] - y[i]; 0, or 30001 when the
// array of differences cannot be allocated.
int RunPairedTForDifferences(PairedT& record, double const* x, double const* y);
// Means and deviations of both samples.
void RunTwoSampleTHelper(TwoSampleT* record, double const* x, double const* y);
// From the means and deviations in the record: difference, standard errors,
// degrees of freedom (and pooled deviation when pooled). Returns the standard
// error of the difference, which is not a field of the record.
double RunTwoSampleTHelper(TwoSampleT* record, bool pooled);

}  // namespace v0
}  // namespace qel

#endif
