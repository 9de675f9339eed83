// Inner pieces of the noncentral t routine, shared between its sources.
#ifndef QEL_SRC_UTILITIES_ELVTINTERNAL_H
#define QEL_SRC_UTILITIES_ELVTINTERNAL_H

namespace qel {
namespace elv {

// Lower tail at t < 0, delta > 0 by Owen's recursion on the integer part of
// df; 0, or 4 when Owen's T failed or the result is exactly -1.
int owenLowerTail(double t, double df, double delta, double* lower);

}  // namespace elv
}  // namespace qel

#endif
