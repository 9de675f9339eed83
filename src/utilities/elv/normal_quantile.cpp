// Normal quantiles for the ELV routines. At full precision algorithm AS 241
// (Wichura 1988, normal_precise.cpp); the historical setting takes the
// starting value of algorithm AS 111 (Beasley & Springer, 1977), refined by
// Newton's method on the gamma law of shape 1/2, since
// P(Z > z) = Q(1/2, z^2/2)/2 for z >= 0.
#include <qel/elv.h>

#include <cerrno>
#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/normal_precise.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

constexpr double kMinNormalP = 1e-100;

// The positive z with upper tail p, under the routine name of the caller's
// frame; range checked by the caller.
void upperNormalQuantile(double p, double* z) {
  if (elvPrecision() == ElvPrecision::Full) {
    *z = -normalQuantile(p);
    ELVexit("normal_upper_quant", 0, 'N');
    return;
  }
  const double d = 1.0 - 2.0 * p;
  if (d <= 1e-5) {
    *z = 1.2533141373155003 * d;  // sqrt(pi/2) (1 - 2p): linear near the centre
    ELVexit("normal_upper_quant", 0, 'N');
    return;
  }
  const double z0 = inv_normal_df0(p);
  double x = z0 * z0 / 2.0;
  if (p > 0.25) {
    gamma_newton(&x, 'L', d, 0.5);
  } else {
    gamma_newton(&x, 'U', 2.0 * p, 0.5);
  }
  *z = std::sqrt(2.0 * x);
  ELVexit("normal_upper_quant", 0, 'N');
}

}  // namespace

extern "C" {

double inv_normal_df0(double p) {
  if (!(p > 0.0 && p < 1.0)) {
    errno = 33;
    return -kHuge;
  }
  const double q = p - 0.5;
  if (std::fabs(q) <= 0.42) {
    const double r = q * q;
    return q * (((-25.44106049637 * r + 41.39119773534) * r - 18.61500062529) * r + 2.50662823884) /
           ((((3.13082909833 * r - 21.06224101826) * r + 23.08336743743) * r - 8.4735109309) * r +
            1.0);
  }
  const double r = std::sqrt(-std::log(q < 0.0 ? p : 1.0 - p));
  const double value =
      (((2.32121276858 * r + 4.85014127135) * r - 2.29796479134) * r - 2.78718931138) /
      ((1.63706781897 * r + 3.54388924762) * r + 1.0);
  return q < 0.0 ? -value : value;
}

void normal_upper_quant(double p, double* z) {
  ELVstartup("normal_upper_quant");
  if (isNan(p) || p < kMinNormalP || p > 0.5) {
    *z = -kHuge;
    ELVexit("normal_upper_quant", 2, 'F');
    return;
  }
  upperNormalQuantile(p, z);
}

void normal_lower_quant(double p, double* z) {
  ELVstartup("normal_lower_quant");
  if (isNan(p) || p < kMinNormalP || p > 0.5) {
    *z = -kHuge;
    ELVexit("normal_lower_quant", 2, 'F');
    return;
  }
  ELVstartup("normal_upper_quant");
  upperNormalQuantile(p, z);
  if (qel::elv::threadStatus() < 2) *z = -*z;
}

}  // extern "C"
