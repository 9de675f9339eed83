// Chi-square distribution with df degrees of freedom, central and
// noncentral: the gamma law at shape df/2 and argument x/2.
#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

bool quantileArgumentsRefused(double p, double df) {
  return anyNan(p, df) || p < kMinQuantileP || p > kMaxQuantileP || df <= 0.0 || df >= kMaxDf;
}

}  // namespace

extern "C" {

void chi2_df(double x, double df, double* lower, double* upper, double* density) {
  static const char* const name = "chi2_df";
  ELVstartup(name);
  if (anyNan(x, df) || df < 0.0 || df > kMaxDf || x < 0.0) {
    ELVexit(name, 2, 'F');
    return;
  }
  double gammaDensity = 0.0;
  gamma_df(x / 2.0, df / 2.0, lower, upper, &gammaDensity);
  // gamma_df leaves the density unwritten at 0 and on failure.
  if (qel::elv::threadStatus() < 2 && ELVmethod != 1) *density = 0.5 * gammaDensity;
  ELVexit(name, 0, 'N');
}

void chi2_ncdf(double x, double df, double L, double* lower, double* upper) {
  static const char* const name = "chi2_ncdf";
  ELVstartup(name);
  if (anyNan(x, df, L) || df < 0.0 || x < 0.0 || L < 0.0 || df > kMaxDf) {
    ELVexit(name, 2, 'F');
    return;
  }
  // The width test takes L itself, not L/2: stricter than gamma_ncdf's.
  if (L + df / 2.0 + kWidthFactor * std::sqrt(L) > kMaxShape) {
    ELVexit(name, 3, 'F');
    return;
  }
  gamma_ncdf(x / 2.0, df / 2.0, L / 2.0, lower, upper);
  ELVexit(name, 0, 'N');
}

void chi2_upper_quant(double p, double df, double* q) {
  static const char* const name = "chi2_upper_quant";
  ELVstartup(name);
  if (quantileArgumentsRefused(p, df)) {
    *q = -kHuge;
    ELVexit(name, 2, 'F');
    return;
  }
  gamma_upper_quant(p, df / 2.0, q);
  if (qel::elv::threadStatus() < 2) *q *= 2.0;
  ELVexit(name, 0, 'N');
}

void chi2_lower_quant(double p, double df, double* q) {
  static const char* const name = "chi2_lower_quant";
  ELVstartup(name);
  if (quantileArgumentsRefused(p, df)) {
    *q = -kHuge;
    ELVexit(name, 2, 'F');
    return;
  }
  gamma_lower_quant(p, df / 2.0, q);
  if (qel::elv::threadStatus() < 2) *q *= 2.0;
  ELVexit(name, 0, 'N');
}

}  // extern "C"
