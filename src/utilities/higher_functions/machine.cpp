// Constants of the arithmetic for the special-function routines, fixed to
// IEEE binary double (the ipmpar/spmpar/exparg scheme of ACM TOMS 708 and the
// D1MACH/I1MACH entries that SLATEC DPSIFN reads).
#include <cmath>
#include <limits>

#include "utilities/higher_functions/transcendental.h"

namespace qel {

namespace {

// 1-based: integer base and digits, largest integer, floating base, then
// digits, smallest and largest exponent of single and of double precision.
const int kIntegerConstants[10] = {2, 31, 2147483647, 2, 24, -125, 128, 53, -1021, 1024};

}  // namespace

int ipmpar(int i) {
  return kIntegerConstants[i - 1];
}

double spmpar(int i) {
  const double b = ipmpar(4);
  if (i <= 1) return std::pow(b, 1 - ipmpar(8));
  if (i == 2) {
    // b^(emin + 2), then three divisions by b: no subnormal step on the way.
    const double binv = 1.0 / b;
    const double w = std::pow(b, ipmpar(9) + 2);
    return ((w * binv) * binv) * binv;
  }
  // (1 - b^-m) b^emax formed without overflow.
  const int m = ipmpar(8);
  const double bm1 = b - 1.0;
  double z = std::pow(b, m - 1);
  const double w = ((z - 1.0) * b + bm1) / (b * z);
  z = std::pow(b, ipmpar(10) - 2);
  return ((w * z) * b) * b;
}

double D1MACH(int i) {
  if (i == 4) return std::ldexp(1.0, -52);
  if (i == 5) return 0.30102999566398;
  return std::numeric_limits<double>::quiet_NaN();
}

int I1MACH(int i) {
  switch (i) {
    case 14:
      return 53;
    case 15:
      return -1021;
    case 16:
      return 1024;
    default:
      return 0;
  }
}

double exparg(int l) {
  const int b = ipmpar(4);
  // Truncated logarithms of the usual bases: exparg needs only an
  // approximate limit, and the 0.99999 factor keeps it on the safe side.
  double lnb;
  if (b == 2) {
    lnb = .69314718055995e+00;
  } else if (b == 8) {
    lnb = 2.0794415416798e+00;
  } else if (b == 16) {
    lnb = 2.7725887222398e+00;
  } else {
    lnb = std::log(static_cast<double>(b));
  }
  const int m = (l == 0) ? ipmpar(10) : ipmpar(9) - 1;
  return 0.99999e+00 * (m * lnb);
}

}  // namespace qel
