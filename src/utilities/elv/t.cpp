// Central t distribution for the ELV routines, through the incomplete beta
// ratio: P(|T| > |t|) = I_x(df/2, 1/2) with x = df/(df + t^2). The tail
// beyond |t| is half of it, computed directly; the other tail is its
// complement. Of the two beta forms the one with the smaller argument is
// used, so that neither x nor 1 - x is formed by cancellation.
#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

// Beyond |t| = 1/this the tails are 0 and 1 to double precision for every
// admissible df.
constexpr double kTinyReciprocal = 1.4916681462400413e-144;

// Positive quantile with P(T > q) = p, under the routine name of the
// caller's frame; arguments checked by the caller.
void upperTQuantile(double p, double df, double* q) {
  static const char* const name = "t_upper_qt";
  const double v = 2.0 * p;
  if (1.0 - v < 1e-12) {
    *q = 0.0;
    ELVexit(name, 0, 'F');
    return;
  }
  // w = df/(df + q^2) and y = 1 - w, from the side where the beta
  // quantile is the small one.
  double w = 0.0, y = 0.0;
  if (p <= 0.25) {
    beta_quant(&w, &y, v, 0.5 * df, 0.5);
  } else {
    beta_quant(&y, &w, 1.0 - v, 0.5, 0.5 * df);
  }
  const int inner = qel::elv::threadStatus();
  if (w == 0.0) {
    *q = -kHuge;
    ELVexit(name, 4, 'F');
    return;
  }
  *q = std::sqrt((y * df / 2.0) / (0.5 * w));
  ELVexit(name, inner, 'F');
}

bool quantileArgumentsValid(double p, double df) {
  return !anyNan(p, df) && p >= kMinQuantileP && p <= kMaxQuantileP && df >= 0.002 && df <= kMaxDf;
}

}  // namespace

extern "C" {

void t_df(double t, double df, double* lower, double* upper) {
  static const char* const name = "t_df";
  ELVstartup(name);
  if (anyNan(t, df) || df < 0.0 || df > kMaxDf) {
    ELVexit(name, 2, 'F');
    return;
  }
  const double magnitude = std::fabs(t);
  if (magnitude > 1.0 && 1.0 / magnitude < kTinyReciprocal) {
    *lower = t < 0.0 ? 0.0 : 1.0;
    *upper = 1.0 - *lower;
    ELVexit(name, 0, 'F');
    return;
  }
  if (t == 0.0) {
    // The median, for every df (and 0/0 for df = 0 below).
    *lower = *upper = 0.5;
    ELVexit(name, 0, 'F');
    return;
  }
  const double u = t * t;
  double inside = 0.0, outside = 0.0, density = 0.0;  // P(|T| <= |t|), P(|T| > |t|)
  if (df >= u) {
    beta_df(u / (df + u), 0.5, 0.5 * df, &inside, &outside, &density);
  } else {
    beta_df(df / (df + u), 0.5 * df, 0.5, &outside, &inside, &density);
  }
  const int inner = qel::elv::threadStatus();
  if (inner >= 2) {
    ELVexit(name, inner, 'F');
    return;
  }
  const double h = 0.5 * outside;
  if (t < 0.0) {
    *lower = h;
    *upper = 1.0 - h;
  } else {
    *upper = h;
    *lower = 1.0 - h;
  }
  ELVexit(name, inner, 'F');
}

void t_upper_quant(double p, double df, double* q) {
  ELVstartup("t_upper_qt");
  if (!quantileArgumentsValid(p, df)) {
    *q = -kHuge;
    ELVexit("t_upper_qt", 2, 'F');
    return;
  }
  upperTQuantile(p, df, q);
}

void t_lower_quant(double p, double df, double* q) {
  ELVstartup("t_lower_qt");
  if (!quantileArgumentsValid(p, df)) {
    *q = -kHuge;
    ELVexit("t_lower_qt", 2, 'F');
    return;
  }
  ELVstartup("t_upper_qt");
  upperTQuantile(p, df, q);
  if (qel::elv::threadStatus() < 2) *q = -*q;
}

}  // extern "C"
