// Both tails of the incomplete beta ratio by TOMS 708 (see beta_ratio.h).
#include "utilities/distributions/beta_ratio.h"

#include <cmath>

#include "utilities/elv/precision.h"
#include "utilities/special_functions/incomplete_beta.h"

namespace qel {
namespace betaratio {

namespace {

// Below this, BRATIO's prefactor x^a y^b / B(a, b) nears the subnormal range.
constexpr double kSmallestDirectTail = 1e-280;

}  // namespace

bool fastTails(double a, double b, double x, double y, double* lower, double* upper) {
  if (elv::elvPrecision() != elv::ElvPrecision::Full) return false;
  if (!(a > 0.0 && b > 0.0 && x > 0.0 && y > 0.0) || std::isinf(a) || std::isinf(b)) return false;
  double w = 0.0, w1 = 0.0;
  int ierr = 0;
  BRATIO(a, b, x, y, &w, &w1, &ierr);
  if (ierr != 0 || !(std::fmin(w, w1) >= kSmallestDirectTail) || !(std::fmax(w, w1) <= 1.0)) {
    return false;
  }
  *lower = w;
  *upper = w1;
  return true;
}

}  // namespace betaratio
}  // namespace qel
