// Forwarding wrappers around the ELV routines (see wrappers.h).
#include "utilities/elv/wrappers.h"
#include "utilities/elv/thread_status.h"

#include <qel/elv.h>

#include <climits>

namespace qel {

namespace {

ElvStatus status() {
  return static_cast<ElvStatus>(qel::elv::threadStatus());
}

// A count beyond the range of the routines' signed index is refused by the
// routine itself (it is above the largest admissible count).
long toIndex(unsigned long k) {
  return k > LONG_MAX ? LONG_MAX : static_cast<long>(k);
}

// Runs a discrete quantile routine and hands its index out unsigned.
template <class Routine>
ElvStatus discreteQuantile(Routine routine, double p, double mean, unsigned long* k,
                           double* fraction) {
  long index = 0;
  routine(&index, fraction, p, mean);
  *k = static_cast<unsigned long>(index < 0 ? 0 : index);
  return status();
}

}  // namespace

bool ElvFailed(ElvStatus s) {
  return !(s == ElvNoError || s == ElvLossOfSignificance);
}

double elv_phi(double x) {
  return phi(x);
}

ElvStatus elv_normal_upper_quant(double p, double* quantile) {
  normal_upper_quant(p, quantile);
  return status();
}

ElvStatus elv_normal_lower_quant(double p, double* quantile) {
  normal_lower_quant(p, quantile);
  return status();
}

ElvStatus elv_gamma_df(double x, double a, double* lower, double* upper, double* density) {
  gamma_df(x, a, lower, upper, density);
  return status();
}

ElvStatus elv_gamma_ncdf(double x, double a, double L, double* lower, double* upper) {
  gamma_ncdf(x, a, L, lower, upper);
  return status();
}

ElvStatus elv_gamma_lower_quant(double p, double a, double* quantile) {
  gamma_lower_quant(p, a, quantile);
  return status();
}

ElvStatus elv_gamma_upper_quant(double p, double a, double* quantile) {
  gamma_upper_quant(p, a, quantile);
  return status();
}

ElvStatus elv_chi2_df(double x, double df, double* lower, double* upper, double* density) {
  chi2_df(x, df, lower, upper, density);
  return status();
}

ElvStatus elv_chi2_ncdf(double x, double df, double L, double* lower, double* upper) {
  chi2_ncdf(x, df, L, lower, upper);
  return status();
}

ElvStatus elv_chi2_lower_quant(double p, double df, double* quantile) {
  chi2_lower_quant(p, df, quantile);
  return status();
}

ElvStatus elv_chi2_upper_quant(double p, double df, double* quantile) {
  chi2_upper_quant(p, df, quantile);
  return status();
}

ElvStatus elv_poisson_df(unsigned long k, double mean, double* lower, double* upper, double* mass) {
  poisson_df(toIndex(k), mean, lower, upper, mass);
  return status();
}

ElvStatus elv_poisson_lower_quant(double p, double mean, unsigned long* k, double* fraction) {
  return discreteQuantile(poisson_lower_quant, p, mean, k, fraction);
}

ElvStatus elv_poisson_upper_quant(double p, double mean, unsigned long* k, double* fraction) {
  return discreteQuantile(poisson_upper_quant, p, mean, k, fraction);
}

}  // namespace qel
