// Forwarding wrappers of the beta, F and binomial ELV routines (see
// wrappers.h): each calls its routine and answers the routine's status.
#include <qel/elv.h>

#include <climits>

#include "utilities/elv/thread_status.h"
#include "utilities/elv/wrappers.h"

namespace qel {

namespace {

ElvStatus status() {
  return static_cast<ElvStatus>(qel::elv::threadStatus());
}

// Counts beyond the signed range are refused by the routines themselves.
long toCount(unsigned long k) {
  return k > LONG_MAX ? LONG_MAX : static_cast<long>(k);
}

template <class Routine>
ElvStatus binomialQuantile(Routine routine, double p, unsigned long n, double prob,
                           unsigned long* k, double* fraction) {
  long index = 0;
  routine(toCount(n), p, prob, &index, fraction);
  *k = static_cast<unsigned long>(index < 0 ? 0 : index);
  return status();
}

}  // namespace

ElvStatus elv_beta_df(double x, double a, double b, double* lower, double* upper, double* density) {
  beta_df(x, a, b, lower, upper, density);
  return status();
}

ElvStatus elv_beta_upper_quant(double p, double a, double b, double* quantile) {
  beta_upper_quant(p, a, b, quantile);
  return status();
}

ElvStatus elv_beta_lower_quant(double p, double a, double b, double* quantile) {
  beta_lower_quant(p, a, b, quantile);
  return status();
}

ElvStatus elv_beta_ncdf(double x, double a, double b, double L, double* lower, double* upper) {
  beta_ncdf(x, a, b, L, lower, upper);
  return status();
}

ElvStatus elv_beta_ncdf2(double x, double a, double b, double L, double* lower, double* upper) {
  beta_ncdf2(x, a, b, L, lower, upper);
  return status();
}

ElvStatus elv_F_df(double x, double df1, double df2, double* lower, double* upper) {
  F_df(x, df1, df2, lower, upper);
  return status();
}

ElvStatus elv_F_ncdf(double x, double df1, double df2, double L, double* lower, double* upper) {
  F_ncdf(x, df1, df2, L, lower, upper);
  return status();
}

ElvStatus elv_F_upper_quant(double p, double df1, double df2, double* quantile) {
  F_upper_quant(p, df1, df2, quantile);
  return status();
}

ElvStatus elv_F_lower_quant(double p, double df1, double df2, double* quantile) {
  F_lower_quant(p, df1, df2, quantile);
  return status();
}

ElvStatus elv_binomial_df(unsigned long k, unsigned long n, double prob, double* lower,
                          double* upper, double* mass) {
  binomial_df(toCount(k), toCount(n), prob, lower, upper, mass);
  return status();
}

ElvStatus elv_binomial_lower_quant(double p, unsigned long n, double prob, unsigned long* k,
                                   double* fraction) {
  return binomialQuantile(binomial_lower_quant, p, n, prob, k, fraction);
}

ElvStatus elv_binomial_upper_quant(double p, unsigned long n, double prob, unsigned long* k,
                                   double* fraction) {
  return binomialQuantile(binomial_upper_quant, p, n, prob, k, fraction);
}

}  // namespace qel
