// The library's road to the ELV routines: one forwarding function per public
// routine, returning the routine's status. Outputs are caller-owned; read
// them only when ElvFailed(status) is false. Status 1 (a tail too small to
// represent, set to 0) is not a failure: the outputs stand as they are.
#ifndef QEL_SRC_UTILITIES_ELVWRAPPERS_H
#define QEL_SRC_UTILITIES_ELVWRAPPERS_H

namespace qel {

enum ElvStatus : int {
  ElvNoError = 0,
  ElvLossOfSignificance = 1,
  ElvArgumentOutOfRange = 2,
  ElvInvalidCombination = 3,
  ElvInternalFailure = 4,
};

// False for 0 and 1, true for every other status.
bool ElvFailed(ElvStatus status);

// Normal
double elv_phi(double x);
ElvStatus elv_normal_upper_quant(double p, double* quantile);
ElvStatus elv_normal_lower_quant(double p, double* quantile);

// Gamma (shape a, unit scale)
ElvStatus elv_gamma_df(double x, double a, double* lower, double* upper, double* density);
ElvStatus elv_gamma_ncdf(double x, double a, double L, double* lower, double* upper);
ElvStatus elv_gamma_lower_quant(double p, double a, double* quantile);
ElvStatus elv_gamma_upper_quant(double p, double a, double* quantile);

// Chi-square
ElvStatus elv_chi2_df(double x, double df, double* lower, double* upper, double* density);
ElvStatus elv_chi2_ncdf(double x, double df, double L, double* lower, double* upper);
ElvStatus elv_chi2_lower_quant(double p, double df, double* quantile);
ElvStatus elv_chi2_upper_quant(double p, double df, double* quantile);

// Poisson: lower = P(X <= k), upper = P(X > k).
ElvStatus elv_poisson_df(unsigned long k, double mean, double* lower, double* upper, double* mass);
ElvStatus elv_poisson_lower_quant(double p, double mean, unsigned long* k, double* fraction);
ElvStatus elv_poisson_upper_quant(double p, double mean, unsigned long* k, double* fraction);

// Normal, t, noncentral t and hypergeometric.
ElvStatus elv_normal_df(double x, double* lower, double* upper);
ElvStatus elv_inv_normal_df(double p, double* quantile);
ElvStatus elv_t_df(double t, double df, double* lower, double* upper);
ElvStatus elv_t_ncdf(double t, double df, double delta, double* lower, double* upper);
ElvStatus elv_t_upper_quant(double p, double df, double* quantile);
ElvStatus elv_t_lower_quant(double p, double df, double* quantile);
// Hypergeometric: lower = P(X <= k), upper = P(X > k).
ElvStatus elv_hypergeo_df(unsigned long k, unsigned long N, unsigned long M, unsigned long n,
                          double* lower, double* upper, double* mass);
ElvStatus elv_hypergeo_lower_quant(double p, unsigned long N, unsigned long M, unsigned long n,
                                   unsigned long* k, double* fraction);
ElvStatus elv_hypergeo_upper_quant(double p, unsigned long N, unsigned long M, unsigned long n,
                                   unsigned long* k, double* fraction);

// Beta (shapes a, b), F (df1, df2) and binomial (n trials); outputs by
// pointer. Binomial: lower = P(X <= k), upper = P(X > k); the quantiles
// come with the fraction f of their defining equation.
ElvStatus elv_beta_df(double x, double a, double b, double* lower, double* upper, double* density);
ElvStatus elv_beta_upper_quant(double p, double a, double b, double* quantile);
ElvStatus elv_beta_lower_quant(double p, double a, double b, double* quantile);
ElvStatus elv_beta_ncdf(double x, double a, double b, double L, double* lower, double* upper);
ElvStatus elv_beta_ncdf2(double x, double a, double b, double L, double* lower, double* upper);
ElvStatus elv_F_df(double x, double df1, double df2, double* lower, double* upper);
ElvStatus elv_F_ncdf(double x, double df1, double df2, double L, double* lower, double* upper);
ElvStatus elv_F_upper_quant(double p, double df1, double df2, double* quantile);
ElvStatus elv_F_lower_quant(double p, double df1, double df2, double* quantile);
ElvStatus elv_binomial_df(unsigned long k, unsigned long n, double prob, double* lower,
                          double* upper, double* mass);
ElvStatus elv_binomial_lower_quant(double p, unsigned long n, double prob, unsigned long* k,
                                   double* fraction);
ElvStatus elv_binomial_upper_quant(double p, unsigned long n, double prob, unsigned long* k,
                                   double* fraction);

}  // namespace qel

#endif
