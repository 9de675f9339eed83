// Distribution functions at large shapes, degrees of freedom, means and
// counts, beyond the range of the ELV routines (shapes above about 9.5e7):
// starting values for the quantile searches, and the noncentral chi-square
// as a Poisson mixture of gamma tails chained by their exact recurrence.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_LARGE_PARAMETERS_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_LARGE_PARAMETERS_H

#include "utilities/distributions/tail_quantile.h"

namespace qel {
namespace large {

// The standard gamma quantile at p by the Wilson-Hilferty cube-root normal
// approximation, a (1 - 1/(9a) + z/(3 sqrt a))^3 (Wilson & Hilferty 1931;
// Johnson, Kotz & Balakrishnan, eq. 17.33), whose relative error is O(1/a):
// a start for the search on the exact tails. NaN where it has no value.
double gammaQuantileStart(double p, double shape);

// The first bracketing step, in log x, of a quantile search around a start
// from gammaQuantileStart: a standard deviation 1/sqrt(a) of log X, but at
// least a few units in the last place of ln x, so that every step moves x.
double logStep(double shape);

// Both tails of the noncentral chi-square on df degrees of freedom at x
// with noncentrality ncp, for df beyond the ELV routines: sum_j w_j P(a+j,
// x/2), w_j the Poisson(ncp/2) weights and a = df/2, with the gamma tails
// chained by P(a+j, y) = P(a+j+1, y) + m_j and Q(a+j+1, y) = Q(a+j, y) + m_j,
// m_j = y^(a+j) e^-y / Gamma(a+j+1), each summed in the direction in which
// it grows, so nothing cancels (Abramowitz & Stegun 26.4.25 and 6.5.21).
// False when a tail fails or the mixture needs more than 10^5 terms.
bool noncentralChiSqTails(double x, double df, double ncp, double* lower, double* upper);

// Both tails of the noncentral F the same way: sum_j w_j I_y(a+j, b) with
// y = df1 x / (df1 x + df2), a = df1/2, b = df2/2, the beta tails from
// BRATIO chained by I_y(a+j+1, b) = I_y(a+j, b) - y^(a+j) (1-y)^b / ((a+j)
// B(a+j, b)) (DLMF 8.17.20). False also for df1 + df2 + ncp beyond 1e306.
bool noncentralFTails(double x, double df1, double df2, double ncp, double* lower, double* upper);

// Both tails of the noncentral t on df degrees of freedom with noncentrality
// delta at x, for a df so large that the first-order term of the expansion
// of E Phi(x W - delta), W = sqrt(chi2_df / df), in 1/df suffices:
// P(T <= x) = Phi(z) - phi(z) (x + x^2 z) / (4 df) + O(df^-2), z = x - delta
// (from E[W - 1] = -1/(4 df) + O(df^-2) and E[(W - 1)^2] = 1/(2 df) +
// O(df^-2); Johnson, Kotz & Balakrishnan, ch. 31). False where the left-out
// term, of the order (1 + |x|)^4 (1 + |z|)^4 / df^2 relative, could reach
// 1e-16; for |z| >= 38 the tails are 0 and 1 (below 1e-300) when df > 1e12.
bool noncentralTTails(double x, double df, double delta, double* lower, double* upper);

// The quantile of a discrete law on the integers from lo: the smallest
// integer k with P(X <= k) >= p, 0 < p < 1, decided on the smaller tail
// (tails(k) gives P(X <= k) and P(X > k)). Beyond 2^53, where every double
// is an integer and not every integer a double, the answer is the smallest
// double k with P(X <= k) >= p: the integer quantile rounded up to a double.
// The search brackets by doubling steps from start (first step spread,
// about a standard deviation) and bisects down to neighbouring doubles.
// NaN when the tails fail.
double discreteQuantile(const TailPair& tails, double p, double lo, double start, double spread);

// The Cornish-Fisher start mean + z sd + (z^2 - 1) skew / 6 for a discrete
// law with that mean, standard deviation and skewness (Johnson, Kemp & Kotz,
// Univariate Discrete Distributions, sec. 4.5), floored and kept at or above
// lo.
double cornishFisherStart(double p, double mean, double sd, double skew, double lo);

}  // namespace large
}  // namespace qel

#endif
