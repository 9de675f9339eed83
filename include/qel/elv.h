/* High-accuracy distribution routines with an error state of their own.
 *
 * Every routine returns both tails, each computed in its own right (the
 * smaller tail as a density times a scaled series, the other as its
 * complement), so that a tail of 1e-300 keeps its relative accuracy. The
 * routines never throw: they report through the process-wide variables below.
 *
 * ELVerrno    0 no errors, 1 partial loss of significance (result set to 0),
 *             2 argument out of range, 3 invalid combination of parameters,
 *             4 internal failure of the algorithm.
 * ELVmethod   which branch or series produced the result (diagnostic).
 * ELVroutine  name of the routine that last started or set ELVerrno.
 * ELVsteps1..3 iteration counters of the last run; ELVsteps4 is reserved.
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

/* Error state. */
extern QEL_API int ELVerrno;
extern QEL_API int64_t ELVmethod;
extern QEL_API char ELVroutine[31]; /* 30 usable bytes and the terminator */
extern QEL_API int64_t ELVsteps1;
extern QEL_API int64_t ELVsteps2;
extern QEL_API int64_t ELVsteps3;
extern QEL_API int64_t ELVsteps4;
extern QEL_API const char* const ELVerrlist[5];

/* Frame: open a run (code 0, name stored); close it. Mode 'F' always stores
 * code and name; any other mode stores them only if code exceeds ELVerrno. */
QEL_API void ELVstartup(const char* name);
QEL_API void ELVexit(const char* name, int code, char mode);
QEL_API const char* ELVstrerror(int code);
QEL_API void ELVperror(const char* prefix);

/* Shared arithmetic. The C errno becomes 33 (domain) or 34 (range) where an
 * argument is refused; ELVerrno is not touched. */
QEL_API double logs(double x); /* log(1 + x) */
QEL_API double exps(double x); /* exp(x) - 1 */
QEL_API void lnpgamma(double* out, double a, double x);
QEL_API void lnpbeta(double* out, double a, double b, double x);
QEL_API void lnppoisson(double k, double* out, double mean);
QEL_API void lnpbinomial(double k, double n, double* out, double prob);
QEL_API void lnphyper(double k, double N, double M, double n, double* out);
QEL_API double ln_gamma(double x);
QEL_API double ln_scaled_gamma(double x); /* log(Gamma(x+1) (e/x)^x) */
QEL_API double Gamma(double x);
QEL_API double gammod(double x); /* (1 - Gamma(1+x))/x on [0, 1] */
QEL_API double psi(double x);
QEL_API double dpsi(double x);
QEL_API double d2psi(double x);
QEL_API double phi(double x); /* standard normal density */

/* Gamma family: shape a, unit scale. Scaled series return 0 or 4. */
QEL_API int gamma_Iax(double* out, double a, double x);
QEL_API int gamma_Jax(double* out, double a, double x);
QEL_API int gamma_J_complete(double* out, double x, double a);
QEL_API double gamma_ps(double x, double a);
QEL_API void gamma_df(double x, double a, double* lower, double* upper, double* density);
QEL_API int gamma_newton(double* x, char mode, double target, double a);
QEL_API void gamma_upper_quant(double p, double a, double* q);
QEL_API void gamma_lower_quant(double p, double a, double* q);
QEL_API void gamma_ncdf(double x, double a, double L, double* lower, double* upper);

/* Chi-square: df degrees of freedom, noncentrality L. */
QEL_API void chi2_df(double x, double df, double* lower, double* upper, double* density);
QEL_API void chi2_ncdf(double x, double df, double L, double* lower, double* upper);
QEL_API void chi2_upper_quant(double p, double df, double* q);
QEL_API void chi2_lower_quant(double p, double df, double* q);

/* Poisson with mean m: lower = P(X <= k), upper = P(X > k). */
QEL_API void poisson_df(long k, double m, double* lower, double* upper, double* mass);
QEL_API int poisson_Ik(long k, double* out, double m);
QEL_API int poisson_Jk(long k, double* out, double m);
QEL_API void poisson_lower_quant(long* k, double* f, double p, double m);
QEL_API void poisson_upper_quant(long* k, double* f, double p, double m);

/* Normal quantiles (positive z with upper tail p; its negative). */
QEL_API double inv_normal_df0(double p);
QEL_API void normal_upper_quant(double p, double* z);
QEL_API void normal_lower_quant(double p, double* z);

/* Standard normal: lower = P(Z <= x), upper = P(Z > x); inverse on
 * [1e-100, 1]. */
QEL_API void normal_df(double x, double* lower, double* upper);
QEL_API void inv_normal_df(double p, double* z);

/* Hypergeometric: population N, M marked, sample n; X marked in the sample.
 * lower = P(X <= k), upper = P(X > k). Quantiles return k and the fraction f
 * with P(X < k) + f P(X = k) = p (lower form) or P(X > k) + f P(X = k) = p
 * (upper form). */
QEL_API void hypergeo_df(unsigned long k, unsigned long N, unsigned long M, unsigned long n,
                         double* lower, double* upper, double* mass);
QEL_API void hyper_intern(unsigned long k, unsigned long N, unsigned long M, unsigned long n,
                          double* lower, double* upper, double* mass);
QEL_API int hyper_Ik(unsigned long k, unsigned long N, unsigned long M, unsigned long n,
                     double* out);
QEL_API int hyper_Jk(unsigned long k, unsigned long N, unsigned long M, unsigned long n,
                     double* out);
QEL_API void hypergeo_lower_quant(unsigned long N, unsigned long M, unsigned long n,
                                  unsigned long* k, double* f, double p);
QEL_API void hypergeo_upper_quant(unsigned long N, unsigned long M, unsigned long n,
                                  unsigned long* k, double* f, double p);

/* Student t with df degrees of freedom and noncentrality delta:
 * lower = P(T <= t), upper = P(T > t). Quantiles for p in [1e-12, 0.5] and
 * df in [0.002, 189812530]. */
QEL_API void t_df(double t, double df, double* lower, double* upper);
QEL_API void t_upper_quant(double p, double df, double* q);
QEL_API void t_lower_quant(double p, double df, double* q);
QEL_API void t_ncdf(double t, double df, double delta, double* lower, double* upper);
/* Complementary Owen's T: the integral from h to infinity of phi(x) Q(a x),
 * a > 0; returns 0 or 4. */
QEL_API int Tha_c(double* out, double h, double a);
/* Far lower tail of the noncentral t at t < 0 < delta by the closed
 * saddle-point expansion to order 1/df (relative error about 1e-4 at
 * df = 10, falling like df^-2); 0 where the boundary does not lie beyond
 * the mode (no lower tail to describe); -1 for arguments outside df in
 * (0, 189812530], finite t and |delta| below 1e6. */
QEL_API double t_saddle_approx(double t, double df, double delta);
/* Far lower tail of the noncentral t at t < 0 for the integer part m of df
 * in 1..12, by a four-term expansion in m/(m + t^2); -1 with ELVerrno 4 for
 * any other m, a NaN argument or |delta| of 1e6 or more. */
QEL_API double t_expansion_approx(double t, double df, double delta);

/* Beta family: shapes a, b; lower = I_x(a,b), upper = 1 - I_x(a,b). The
 * scaled series return 0 or 4: I_x(a,b) = density * beta_Iabx,
 * 1 - I_x(a,b) = density (1-x)/b * beta_Jabx. */
QEL_API int beta_Iabx(double* out, double a, double b, double x);
QEL_API int beta_Jabx(double* out, double a, double b, double x);
QEL_API int beta_J_complete(double* out, double a, double b, double x);
QEL_API double beta_ps(double x, double a, double b);
QEL_API double beta_lntab(double a, double b); /* ln(b^a Gamma(b)/Gamma(a+b)) */
QEL_API void beta_df(double x, double a, double b, double* lower, double* upper, double* density);
/* Noncentral beta: Poisson(L) mixture of I_x(a+j, b) (beta_ncdf) or of
 * I_x(a, b+j) (beta_ncdf2). */
QEL_API void beta_ncdf(double x, double a, double b, double L, double* lower, double* upper);
QEL_API void beta_ncdf2(double x, double a, double b, double L, double* lower, double* upper);
/* Newton iteration on beta_df: mode 'L' solves lower = target, 'U' upper. */
QEL_API int beta_newton(double* x, char mode, double target, double a, double b);
/* Starting values of the quantile: modes -1, 1 (small x), -2, 2 (Cornish-Fisher). */
QEL_API void beta_quant0(int mode, double* q1, double* q2, double p, double a, double b);
/* x with I_x(a,b) = p in lower, 1 - x in upper; returns the code left in ELVerrno. */
QEL_API int beta_quant(double* lower, double* upper, double p, double a, double b);
QEL_API void beta_upper_quant(double p, double a, double b, double* q);
QEL_API void beta_lower_quant(double p, double a, double b, double* q);

/* Binomial with n trials: lower = P(X <= k), upper = P(X > k). */
QEL_API void binomial_df(long k, long n, double prob, double* lower, double* upper, double* mass);
QEL_API int binomial_Ik(long k, long n, double* out, double prob);
QEL_API int binomial_Jk(long k, long n, double* out, double prob);
/* Quantiles with the fraction f: lower form P(X < k) + f P(X = k) = p,
 * upper form P(X > k) + f P(X = k) = p. */
QEL_API void binomial_upper_quant(long n, double p, double prob, long* k, double* f);
QEL_API void binomial_lower_quant(long n, double p, double prob, long* k, double* f);

/* F with df1, df2 degrees of freedom and noncentrality L. */
QEL_API void F_df(double x, double df1, double df2, double* lower, double* upper);
QEL_API void F_ncdf(double x, double df1, double df2, double L, double* lower, double* upper);
QEL_API void F_upper_quant(double p, double df1, double df2, double* q);
QEL_API void F_lower_quant(double p, double df1, double df2, double* q);

#ifdef __cplusplus
}
#endif

#endif
