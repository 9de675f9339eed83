// Inner pieces of the noncentral t routine, shared between its sources.
#ifndef QEL_SRC_UTILITIES_ELVTINTERNAL_H
#define QEL_SRC_UTILITIES_ELVTINTERNAL_H

namespace qel {
namespace elv {

// Lower tail at t < 0, delta > 0 by Owen's recursion on the integer part of
// df; 0, or 4 when Owen's T failed or the result is exactly -1.
int owenLowerTail(double t, double df, double delta, double* lower);

// Beyond this |t| the saddle forms answer 0 or 1 (t squared would overflow).
constexpr double kSaddleMaxT = 1e140;

// The argument check shared by the saddle forms: df in (0, kMaxDf], finite
// t, |delta| below 1e6, no NaN.
bool saddleArgumentsValid(double t, double df, double delta);

// Lower tail of the noncentral t by the integral around its saddle point
// (relative error about 1e-13); -1 for arguments the check refuses.
double t_saddle_integral(double t, double df, double delta);

}  // namespace elv
}  // namespace qel

#endif
