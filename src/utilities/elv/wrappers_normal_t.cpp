// Forwarding wrappers of the normal, t and hypergeometric ELV routines (see
// wrappers.h). Outputs are pointers to caller-owned values.
#include <qel/elv.h>

#include "utilities/elv/wrappers.h"
#include "utilities/elv/thread_status.h"

namespace qel {

namespace {

ElvStatus currentStatus() {
  return static_cast<ElvStatus>(qel::elv::threadStatus());
}

}  // namespace

ElvStatus elv_normal_df(double x, double* lower, double* upper) {
  normal_df(x, lower, upper);
  return currentStatus();
}

ElvStatus elv_inv_normal_df(double p, double* quantile) {
  inv_normal_df(p, quantile);
  return currentStatus();
}

ElvStatus elv_t_df(double t, double df, double* lower, double* upper) {
  t_df(t, df, lower, upper);
  return currentStatus();
}

ElvStatus elv_t_ncdf(double t, double df, double delta, double* lower, double* upper) {
  t_ncdf(t, df, delta, lower, upper);
  return currentStatus();
}

ElvStatus elv_t_upper_quant(double p, double df, double* quantile) {
  t_upper_quant(p, df, quantile);
  return currentStatus();
}

ElvStatus elv_t_lower_quant(double p, double df, double* quantile) {
  t_lower_quant(p, df, quantile);
  return currentStatus();
}

ElvStatus elv_hypergeo_df(unsigned long k, unsigned long N, unsigned long M, unsigned long n,
                          double* lower, double* upper, double* mass) {
  hypergeo_df(k, N, M, n, lower, upper, mass);
  return currentStatus();
}

ElvStatus elv_hypergeo_lower_quant(double p, unsigned long N, unsigned long M, unsigned long n,
                                   unsigned long* k, double* fraction) {
  hypergeo_lower_quant(N, M, n, k, fraction, p);
  return currentStatus();
}

ElvStatus elv_hypergeo_upper_quant(double p, unsigned long N, unsigned long M, unsigned long n,
                                   unsigned long* k, double* fraction) {
  hypergeo_upper_quant(N, M, n, k, fraction, p);
  return currentStatus();
}

}  // namespace qel
