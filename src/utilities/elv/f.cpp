// F distribution with df1 and df2 degrees of freedom, central and
// noncentral, on the beta law: with c = df1/2, d = df2/2 and y = d + c x,
//   P(F <= x) = I_{cx/y}(c, d) = 1 - I_{d/y}(d, c).
// The argument below 1/2 is the one passed on, so that the beta routines
// work on the tail they compute directly. The noncentrality L of F enters
// the beta mixture as L/2.
#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

constexpr double kMinQuantileDf = 0.002;

bool dfRefused(double x, double df1, double df2) {
  return anyNan(x, df1, df2) || x < 0.0 || df1 < 0.0 || df2 < 0.0 || x > kMaxDf || df1 > kMaxDf ||
         df2 > kMaxDf;
}

bool quantileRefused(double p, double df1, double df2) {
  if (anyNan(p, df1, df2) || p < kMinQuantileP || p > kMaxQuantileP) return true;
  const double smaller = df1 < df2 ? df1 : df2;
  const double larger = df1 < df2 ? df2 : df1;
  return smaller < kMinQuantileDf || larger > kMaxDf;
}

// Beta arguments of the two forms; x c <= d selects the first.
struct BetaArguments {
  bool first;
  double argument;
};

BetaArguments betaArguments(double x, double c, double d) {
  const double y = d + x * c;
  if (x * c <= d) return {true, y > 0.0 ? x * c / y : 0.0};
  return {false, d / y};
}

}  // namespace

extern "C" {

void F_df(double x, double df1, double df2, double* lower, double* upper) {
  static const char* const name = "F_df";
  ELVstartup(name);
  if (dfRefused(x, df1, df2)) {
    ELVexit(name, 2, 'F');
    return;
  }
  const double c = df1 / 2.0, d = df2 / 2.0;
  const BetaArguments args = betaArguments(x, c, d);
  double density;
  if (args.first) {
    beta_df(args.argument, c, d, lower, upper, &density);
  } else {
    beta_df(args.argument, d, c, upper, lower, &density);
  }
  ELVexit(name, 0, 'N');
}

void F_ncdf(double x, double df1, double df2, double L, double* lower, double* upper) {
  static const char* const name = "F_ncdf";
  ELVstartup(name);
  if (dfRefused(x, df1, df2) || isNan(L) || L < 0.0) {
    ELVexit(name, 2, 'F');
    return;
  }
  const double c = df1 / 2.0, d = df2 / 2.0;
  const BetaArguments args = betaArguments(x, c, d);
  if (args.first) {
    beta_ncdf(args.argument, c, d, L / 2.0, lower, upper);
  } else {
    beta_ncdf2(args.argument, d, c, L / 2.0, upper, lower);
  }
  ELVexit(name, 0, 'N');
}

// Point q with P(F > q) = p: d/(d + c q) is the lower p-quantile y of the
// beta law (d, c), so q = (d/(c y)) (1 - y). Both quantiles report under
// one name, and keep it with the code of the beta quantile.
void F_upper_quant(double p, double df1, double df2, double* q) {
  static const char* const name = "F_upper_qt";
  ELVstartup(name);
  if (quantileRefused(p, df1, df2)) {
    *q = -kHuge;
    ELVexit(name, 2, 'F');
    return;
  }
  const double c = df1 / 2.0, d = df2 / 2.0;
  double y = 0.0, w = 0.0;
  beta_quant(&y, &w, p, d, c);
  if (y == 0.0) {
    ELVexit(name, 4, 'F');
    return;
  }
  *q = (d / (c * y)) * w;
  ELVexit(name, qel::elv::threadStatus(), 'F');
}

// Point q with P(F <= q) = p: c q/(d + c q) is the lower p-quantile y of the
// beta law (c, d), so q = (d/(c w)) y with w = 1 - y.
void F_lower_quant(double p, double df1, double df2, double* q) {
  static const char* const name = "F_upper_qt";
  ELVstartup(name);
  if (quantileRefused(p, df1, df2)) {
    *q = -kHuge;
    ELVexit(name, 2, 'F');
    return;
  }
  const double c = df1 / 2.0, d = df2 / 2.0;
  double y = 0.0, w = 0.0;
  beta_quant(&y, &w, p, c, d);
  if (w == 0.0) {
    ELVexit(name, 4, 'F');
    return;
  }
  *q = (d / (c * w)) * y;
  ELVexit(name, qel::elv::threadStatus(), 'F');
}

}  // extern "C"
