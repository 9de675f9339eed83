// Standard normal distribution function for the ELV routines. Both tails are
// computed: the smaller one directly as erfc(|x|/sqrt 2)/2 and the larger as
// its complement. At full precision erfc comes from the scaled complementary
// error function with an exact exponent (normal_precise.cpp); the historical
// setting takes erfc(z) as the upper tail of the gamma law of shape 1/2 at z^2. The inverse over
// the whole open interval rides on the upper quantile of normal_quantile.cpp.
#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/normal_precise.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

constexpr double kSqrt2 = 1.4142135623730951;
// erfc(z) is below the smallest positive double beyond this.
constexpr double kErfcZero = 26.5694;
// erfc(z) rounds to 1 below this.
constexpr double kErfcOne = 1e-14;

double erfcByGamma(double z) {
  if (z > kErfcZero) return 0.0;
  if (z < kErfcOne) return 1.0;
  double lower, upper, density;
  gamma_df(z * z, 0.5, &lower, &upper, &density);
  return upper;
}

}  // namespace

extern "C" {

void normal_df(double x, double* lower, double* upper) {
  ELVstartup("normal_df");
  if (isNan(x)) {
    *lower = *upper = -kHuge;
    ELVexit("normal_df", 2, 'F');
    return;
  }
  if (elvPrecision() == ElvPrecision::Full) {
    // The routine keeps its documented limits: erfc is 0 beyond 26.5694, and
    // a tail below the underflow limit is an exact 0 with code 1.
    double small = std::fabs(x) / kSqrt2 > kErfcZero ? 0.0 : normalUpperTail(std::fabs(x));
    if (small > 0.0 && small < kTinyArgument) {
      small = 0.0;
      ELVexit("normal_df", 1, 'N');
    }
    *(x >= 0.0 ? upper : lower) = small;
    *(x >= 0.0 ? lower : upper) = 1.0 - small;
  } else if (x >= 0.0) {
    *upper = 0.5 * erfcByGamma(x / kSqrt2);
    *lower = 1.0 - *upper;
  } else {
    *lower = 0.5 * erfcByGamma(-x / kSqrt2);
    *upper = 1.0 - *lower;
  }
  if (qel::elv::threadStatus() >= 2) *lower = *upper = -kHuge;
  ELVexit("normal_df", 0, 'N');
}

void inv_normal_df(double p, double* z) {
  ELVstartup("inv_normal_df");
  if (isNan(p) || p < 1e-100 || p > 1.0) {
    *z = -kHuge;
    ELVexit("inv_normal_df", 2, 'F');
    return;
  }
  if (p < 0.5) {
    normal_upper_quant(p, z);
    if (qel::elv::threadStatus() < 2) *z = -*z;
  } else {
    // p = 1 gives 1 - p = 0, which the upper quantile refuses with code 2.
    normal_upper_quant(1.0 - p, z);
  }
}

}  // extern "C"
