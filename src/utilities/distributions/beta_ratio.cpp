// Both tails of the incomplete beta ratio by TOMS 708 (see beta_ratio.h).
#include "utilities/distributions/beta_ratio.h"

#include <cmath>
#include <exception>

#include "utilities/elv/precision.h"
#include "utilities/higher_functions/incomplete_beta.h"

namespace qel {
namespace betaratio {

namespace {

// Below this, BRATIO's prefactor x^a y^b / B(a, b) nears the subnormal range.
constexpr double kSmallestDirectTail = 1e-280;
// Shapes up to 1e306, so that a + b and the products a y, b x of BRATIO's
// lambda stay finite (it forms lambda from them exactly beyond 2^26).
constexpr double kLargestShape = 1e306;

}  // namespace

namespace {

bool bratioTails(double a, double b, double x, double y, double floor, double* lower,
                 double* upper) {
  // Quiet comparisons: a NaN must not raise the invalid operation in an armed
  // thread.
  if (!(std::isgreater(a, 0.0) && std::isgreater(b, 0.0) && std::isgreater(x, 0.0) &&
        std::isgreater(y, 0.0) && std::islessequal(a, kLargestShape) &&
        std::islessequal(b, kLargestShape))) {
    return false;
  }
  double w = 0.0, w1 = 0.0;
  int ierr = 0;
  try {
    BRATIO(a, b, x, y, &w, &w1, &ierr);
  } catch (const std::exception&) {
    return false;  // a trap at extreme arguments: the ELV routine decides
  }
  // Written out rather than fmin/fmax (a libm call each); NaN fails each test.
  if (ierr != 0 || !(w >= floor && w1 >= floor && w <= 1.0 && w1 <= 1.0)) return false;
  *lower = w;
  *upper = w1;
  return true;
}

}  // namespace

bool fastTails(double a, double b, double x, double y, double* lower, double* upper) {
  if (elv::elvPrecision() != elv::ElvPrecision::Full) return false;
  return bratioTails(a, b, x, y, kSmallestDirectTail, lower, upper);
}

bool anyTails(double a, double b, double x, double y, double* lower, double* upper) {
  return bratioTails(a, b, x, y, 0.0, lower, upper);
}

}  // namespace betaratio
}  // namespace qel
