// Inner pieces of the noncentral t routine, shared between its sources.
#ifndef QEL_SRC_UTILITIES_ELVTINTERNAL_H
#define QEL_SRC_UTILITIES_ELVTINTERNAL_H

namespace qel {
namespace elv {

// Lower tail at t < 0, delta > 0 by Owen's recursion on the integer part of
// df; 0, or 4 when Owen's T failed or the result is exactly -1.
int owenLowerTail(double t, double df, double delta, double* lower);

// The start shared by the saddle forms: x = t/sqrt(df), d = delta/sqrt(df)
// and the saddle r = (x d + sqrt(x^2 d^2 + 4(1 + x^2)))/(2(1 + x^2)).
struct SaddleStart {
  double sqrtDf, x, d, onePlus, r;
};

// Fills *start and returns false, or returns true with the whole answer in
// *answer: -1 for refused arguments (NaN, df outside (0, kMaxDf], |t| not
// finite, |delta| of 1e6 or more), 0 or 1 beyond |t| = 1e140, where t
// squared would overflow. Sets the three step counters to 0.
bool saddleShortcut(double t, double df, double delta, SaddleStart* start, double* answer);

// Lower tail of the noncentral t by the integral around its saddle point
// (relative error about 1e-13); -1 for arguments the check refuses.
double t_saddle_integral(double t, double df, double delta);

}  // namespace elv
}  // namespace qel

#endif
