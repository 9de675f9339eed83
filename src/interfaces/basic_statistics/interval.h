// Inner side of the location tests: the helpers that the Run forms share
// (the symmetric interval maker is declared in <qel/interval.h>).
#ifndef QEL_SRC_INTERFACES_BASIC_STATISTICS_INTERVAL_H
#define QEL_SRC_INTERFACES_BASIC_STATISTICS_INTERVAL_H

#include <qel/basic_types.h>
#include <qel/interval.h>
#include <qel/location_tests.h>

#include "interfaces/math/random_distributions_v0.h"

namespace qel {
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
