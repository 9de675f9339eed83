// Both tails of the noncentral t distribution at double precision, for the
// exported distribution functions (the ELV routine t_ncdf keeps its own
// method and step counts).
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_NONCENTRAL_T_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_NONCENTRAL_T_H

namespace qel {
namespace nct {

// P(T <= t) and P(T > t) for T noncentral t with df > 0 degrees of freedom
// and noncentrality delta (finite, not NaN; t finite). False, with nothing
// stored, for parameters outside the range this method covers (the caller
// falls back on the ELV routine there).
bool tails(double t, double df, double delta, double* lower, double* upper);

// Below this df, tails() takes tinyDfTails().
constexpr double kTinyDfLimit = 0.01;

// tails() for 0 < df < kTinyDfLimit, any finite t and delta, by the
// integral over the normal law of the tails of the chi-square part
// (noncentral_t_tiny_df.cpp). False outside that range.
bool tinyDfTails(double t, double df, double delta, double* lower, double* upper);

// The density at t != 0 for 4 DBL_MIN <= df < kTinyDfLimit (NaN outside),
// by the same integral, where the recurrence between distribution
// functions at df and df + 2 cancels.
double tinyDfDensity(double t, double df, double delta);

}  // namespace nct
}  // namespace qel

#endif
