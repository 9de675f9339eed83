/** \file
 * High-accuracy distribution routines with an error state of their own.
 *
 * Every routine returns both tails, each computed in its own right (the
 * smaller tail as a density times a scaled series, the other as its
 * complement), so that a tail of 1e-300 keeps its relative accuracy. The
 * routines never throw: they report through the process-wide variables below.
 *
 * - ELVerrno: 0 no errors, 1 partial loss of significance (result set to 0),
 *   2 argument out of range, 3 invalid combination of parameters,
 *   4 internal failure of the algorithm.
 * - ELVmethod: which branch or series produced the result (diagnostic).
 * - ELVroutine: name of the routine that last started or set ELVerrno.
 * - ELVsteps1..3: iteration counters of the last run; ELVsteps4 is reserved.
 *
 * The state is shared by all threads without a lock: a status read after a
 * call may stem from another thread's run. Outputs of a run with ELVerrno of
 * 2 or more are not to be read (quantiles then hold -DBL_MAX).
 */
#ifndef QEL_ELV_H
#define QEL_ELV_H

#include <qel/export.h>

#ifdef __cplusplus
#include <cstdint>
extern "C" {
#else
#include <stdint.h>
#endif

/** \name Error state
 * Error state.
 * @{ */
/** Code of the last run: 0 to 4, see the file description. */
extern QEL_API int ELVerrno;
/** Which branch or series produced the last result (diagnostic). */
extern QEL_API int64_t ELVmethod;
extern QEL_API char ELVroutine[31]; /**< 30 usable bytes and the terminator */
/** Iteration counter of the last run. */
extern QEL_API int64_t ELVsteps1;
/** Iteration counter of the last run. */
extern QEL_API int64_t ELVsteps2;
/** Iteration counter of the last run. */
extern QEL_API int64_t ELVsteps3;
/** Reserved. */
extern QEL_API int64_t ELVsteps4;
/** Messages of the codes 0 to 4. */
extern QEL_API const char* const ELVerrlist[5];
/** @} */

/** \name Frame
 * Frame: open a run (code 0, name stored); close it. Mode 'F' always stores
 * code and name; any other mode stores them only if code exceeds ELVerrno.
 * @{ */
/** Opens a run: ELVerrno 0, the routine name stored. */
QEL_API void ELVstartup(const char* name);
/** Closes a run: mode 'F' always stores code and name; any other mode only
 * when code exceeds the code of the run. */
QEL_API void ELVexit(const char* name, int code, char mode);
/** The message of code, which must be one of 0 to 4. */
QEL_API const char* ELVstrerror(int code);
/** Prints the message of ELVerrno and the routine name to stderr, after
 * prefix when it is not null. */
QEL_API void ELVperror(const char* prefix);
/** @} */

/** \name Shared arithmetic
 * Shared arithmetic. The C errno becomes 33 (domain) or 34 (range) where an
 * argument is refused; ELVerrno is not touched.
 * @{ */
QEL_API double logs(double x); /**< log(1 + x) */
QEL_API double exps(double x); /**< exp(x) - 1 */
/** *out = log of the gamma density x^(a-1) e^-x / Gamma(a), formed without
 * cancellation near the mode. */
QEL_API void lnpgamma(double* out, double a, double x);
/** *out = log of the beta density of shapes a, b at x. */
QEL_API void lnpbeta(double* out, double a, double b, double x);
/** *out = log of the Poisson mass mean^k e^-mean / k!. */
QEL_API void lnppoisson(double k, double* out, double mean);
/** *out = log of the binomial mass of k in n trials with probability prob. */
QEL_API void lnpbinomial(double k, double n, double* out, double prob);
/** *out = log of the hypergeometric mass of k (population N, M marked,
 * sample n). */
QEL_API void lnphyper(double k, double N, double M, double n, double* out);
/** log Gamma(x) for x > 0. */
QEL_API double ln_gamma(double x);
QEL_API double ln_scaled_gamma(double x); /**< log(Gamma(x+1) (e/x)^x) */
/** Gamma(x). */
QEL_API double Gamma(double x);
QEL_API double gammod(double x); /**< (1 - Gamma(1+x))/x on [0, 1] */
/** Digamma: the derivative of log Gamma(x). */
QEL_API double psi(double x);
/** Trigamma: the derivative of psi. */
QEL_API double dpsi(double x);
/** Tetragamma: the second derivative of psi. */
QEL_API double d2psi(double x);
QEL_API double phi(double x); /**< standard normal density */
/** @} */

/** \name Gamma
 * Gamma family: shape a, unit scale. Scaled series return 0 or 4.
 * @{ */
/** Lower-tail factor 1 + x/(a+1) + x^2/((a+1)(a+2)) + ...: P(a, x) is the
 * density times x/a times *out. */
QEL_API int gamma_Iax(double* out, double a, double x);
/** Upper-tail factor J(a, x) = Gamma(a, x) e^x x^(1-a). */
QEL_API int gamma_Jax(double* out, double a, double x);
/** J(a, x) for 0 <= a < 1 (power series or Legendre's continued fraction). */
QEL_API int gamma_J_complete(double* out, double x, double a);
/** Gamma(a, x) for a < 1, x < 1 by the power series. */
QEL_API double gamma_ps(double x, double a);
/** Both tails P(a, x), Q(a, x) and the density at x. */
QEL_API void gamma_df(double x, double a, double* lower, double* upper, double* density);
/** Newton iteration on gamma_df for the point where the lower ('L') or upper
 * ('U') tail equals target; *x holds the start and receives the result. */
QEL_API int gamma_newton(double* x, char mode, double target, double a);
/** Point q with Q(a, q) = p. */
QEL_API void gamma_upper_quant(double p, double a, double* q);
/** Point q with P(a, q) = p. */
QEL_API void gamma_lower_quant(double p, double a, double* q);
/** Both tails of the noncentral gamma law (Poisson mixture of noncentrality L). */
QEL_API void gamma_ncdf(double x, double a, double L, double* lower, double* upper);
/** @} */

/** \name Chi-square
 * Chi-square: df degrees of freedom, noncentrality L.
 * @{ */
/** Both tails and the density of the chi-square law. */
QEL_API void chi2_df(double x, double df, double* lower, double* upper, double* density);
/** Both tails of the noncentral chi-square law. */
QEL_API void chi2_ncdf(double x, double df, double L, double* lower, double* upper);
/** Point q with P(X > q) = p. */
QEL_API void chi2_upper_quant(double p, double df, double* q);
/** Point q with P(X <= q) = p. */
QEL_API void chi2_lower_quant(double p, double df, double* q);
/** @} */

/** \name Poisson
 * Poisson with mean m: lower = P(X <= k), upper = P(X > k).
 * @{ */
/** Both tails and the mass at k. */
QEL_API void poisson_df(long k, double m, double* lower, double* upper, double* mass);
/** P(X > k) / P(X = k) = m/(k+1) + m^2/((k+1)(k+2)) + ... */
QEL_API int poisson_Ik(long k, double* out, double m);
/** P(X <= k) / P(X = k) = 1 + k/m + k(k-1)/m^2 + ... */
QEL_API int poisson_Jk(long k, double* out, double m);
/** Smallest k with P(X <= k) > p, and f = (p - P(X < k)) / P(X = k). */
QEL_API void poisson_lower_quant(long* k, double* f, double p, double m);
/** Largest k with P(X > k) <= p, and f = (p - P(X > k)) / P(X = k). */
QEL_API void poisson_upper_quant(long* k, double* f, double p, double m);
/** @} */

/** \name Normal
 * Normal quantiles (positive z with upper tail p; its negative).
 * @{ */
/** Quick z with P(Z <= z) = p by AS 111 (Beasley and Springer), to about
 * nine digits; errno 33 and -DBL_MAX for p outside (0, 1). */
QEL_API double inv_normal_df0(double p);
/** *z with P(Z > z) = p. */
QEL_API void normal_upper_quant(double p, double* z);
/** *z with P(Z <= z) = p. */
QEL_API void normal_lower_quant(double p, double* z);

/** Standard normal: lower = P(Z <= x), upper = P(Z > x); inverse on
 * [1e-100, 1]. */
QEL_API void normal_df(double x, double* lower, double* upper);
/** *z with P(Z <= z) = p, for p in [1e-100, 1]. */
QEL_API void inv_normal_df(double p, double* z);
/** @} */

/** \name Hypergeometric
 * Hypergeometric: population N, M marked, sample n; X marked in the sample.
 * lower = P(X <= k), upper = P(X > k). Quantiles return k and the fraction f
 * with P(X < k) + f P(X = k) = p (lower form) or P(X > k) + f P(X = k) = p
 * (upper form).
 * @{ */
/** Both tails and the mass at k, after checking the arguments. */
QEL_API void hypergeo_df(unsigned long k, unsigned long N, unsigned long M, unsigned long n,
                         double* lower, double* upper, double* mass);
/** The same without the argument checks and reductions of hypergeo_df. */
QEL_API void hyper_intern(unsigned long k, unsigned long N, unsigned long M, unsigned long n,
                          double* lower, double* upper, double* mass);
/** P(X > k) / P(X = k) by its series. */
QEL_API int hyper_Ik(unsigned long k, unsigned long N, unsigned long M, unsigned long n,
                     double* out);
/** P(X <= k) / P(X = k) by its series. */
QEL_API int hyper_Jk(unsigned long k, unsigned long N, unsigned long M, unsigned long n,
                     double* out);
/** k and f with P(X < k) + f P(X = k) = p. */
QEL_API void hypergeo_lower_quant(unsigned long N, unsigned long M, unsigned long n,
                                  unsigned long* k, double* f, double p);
/** k and f with P(X > k) + f P(X = k) = p. */
QEL_API void hypergeo_upper_quant(unsigned long N, unsigned long M, unsigned long n,
                                  unsigned long* k, double* f, double p);
/** @} */

/** \name Student t
 * Student t with df degrees of freedom and noncentrality delta:
 * lower = P(T <= t), upper = P(T > t). Quantiles for p in [1e-12, 0.5] and
 * df in [0.002, 189812530].
 * @{ */
/** Both tails of the central t law. */
QEL_API void t_df(double t, double df, double* lower, double* upper);
/** Point q with P(T > q) = p. */
QEL_API void t_upper_quant(double p, double df, double* q);
/** Point q with P(T <= q) = p. */
QEL_API void t_lower_quant(double p, double df, double* q);
/** Both tails of the noncentral t law. */
QEL_API void t_ncdf(double t, double df, double delta, double* lower, double* upper);
/** Complementary Owen's T: the integral from h to infinity of phi(x) Q(a x),
 * a > 0; returns 0 or 4. */
QEL_API int Tha_c(double* out, double h, double a);
/** Far lower tail of the noncentral t at t < 0 < delta by the closed
 * saddle-point expansion to order 1/df (relative error about 1e-4 at
 * df = 10, falling like df^-2); 0 where the boundary does not lie beyond
 * the mode (no lower tail to describe); -1 for arguments outside df in
 * (0, 189812530], finite t and |delta| below 1e6. */
QEL_API double t_saddle_approx(double t, double df, double delta);
/** Far lower tail of the noncentral t at t < 0 for the integer part m of df
 * in 1..12, by a four-term expansion in m/(m + t^2); -1 with ELVerrno 4 for
 * any other m, a NaN argument or |delta| of 1e6 or more. */
QEL_API double t_expansion_approx(double t, double df, double delta);
/** @} */

/** \name Beta
 * Beta family: shapes a, b; lower = I_x(a,b), upper = 1 - I_x(a,b). The
 * scaled series return 0 or 4: I_x(a,b) = density * beta_Iabx,
 * 1 - I_x(a,b) = density (1-x)/b * beta_Jabx.
 * @{ */
/** Scaled series of the lower tail: I_x(a,b) = density * *out. */
QEL_API int beta_Iabx(double* out, double a, double b, double x);
/** Scaled series of the upper tail: 1 - I_x(a,b) = density (1-x)/b * *out. */
QEL_API int beta_Jabx(double* out, double a, double b, double x);
/** The factor of beta_Jabx for 0 <= a < 1, where the finite form has no end. */
QEL_API int beta_J_complete(double* out, double a, double b, double x);
/** b^a (B(a,b) - B_x(a,b)) for a < 1 and b x < 1, by the power series. */
QEL_API double beta_ps(double x, double a, double b);
QEL_API double beta_lntab(double a, double b); /**< ln(b^a Gamma(b)/Gamma(a+b)) */
/** Both tails and the density at x. */
QEL_API void beta_df(double x, double a, double b, double* lower, double* upper, double* density);
/** Noncentral beta: Poisson(L) mixture of I_x(a+j, b) (beta_ncdf) or of
 * I_x(a, b+j) (beta_ncdf2). */
QEL_API void beta_ncdf(double x, double a, double b, double L, double* lower, double* upper);
/** Both tails, Poisson(L) mixture of I_x(a, b+j). */
QEL_API void beta_ncdf2(double x, double a, double b, double L, double* lower, double* upper);
/** Newton iteration on beta_df: mode 'L' solves lower = target, 'U' upper. */
QEL_API int beta_newton(double* x, char mode, double target, double a, double b);
/** Starting values of the quantile: modes -1, 1 (small x), -2, 2 (Cornish-Fisher). */
QEL_API void beta_quant0(int mode, double* q1, double* q2, double p, double a, double b);
/** x with I_x(a,b) = p in lower, 1 - x in upper; returns the code left in ELVerrno. */
QEL_API int beta_quant(double* lower, double* upper, double p, double a, double b);
/** Point q with P(X > q) = p. */
QEL_API void beta_upper_quant(double p, double a, double b, double* q);
/** Point q with P(X <= q) = p. */
QEL_API void beta_lower_quant(double p, double a, double b, double* q);
/** @} */

/** \name Binomial
 * Binomial with n trials: lower = P(X <= k), upper = P(X > k).
 * @{ */
/** Both tails and the mass at k. */
QEL_API void binomial_df(long k, long n, double prob, double* lower, double* upper, double* mass);
/** P(X > k) / P(X = k) by its series. */
QEL_API int binomial_Ik(long k, long n, double* out, double prob);
/** P(X <= k) / P(X = k) by its series. */
QEL_API int binomial_Jk(long k, long n, double* out, double prob);
/** Quantiles with the fraction f: lower form P(X < k) + f P(X = k) = p,
 * upper form P(X > k) + f P(X = k) = p. */
QEL_API void binomial_upper_quant(long n, double p, double prob, long* k, double* f);
/** k and f with P(X < k) + f P(X = k) = p. */
QEL_API void binomial_lower_quant(long n, double p, double prob, long* k, double* f);
/** @} */

/** \name F
 * F with df1, df2 degrees of freedom and noncentrality L.
 * @{ */
/** Both tails of the central F law. */
QEL_API void F_df(double x, double df1, double df2, double* lower, double* upper);
/** Both tails of the noncentral F law. */
QEL_API void F_ncdf(double x, double df1, double df2, double L, double* lower, double* upper);
/** Point q with P(F > q) = p. */
QEL_API void F_upper_quant(double p, double df1, double df2, double* q);
/** Point q with P(F <= q) = p. */
QEL_API void F_lower_quant(double p, double df1, double df2, double* q);
/** @} */

#ifdef __cplusplus
}
#endif

#endif
