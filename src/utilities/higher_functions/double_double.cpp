// Double-double exponential (see double_double.h), after Tang's table-driven
// method (P. T. P. Tang, "Table-driven implementation of the exponential
// function in IEEE floating-point arithmetic", ACM TOMS 15 (1989) 144-157):
// a = (32 m + j) ln2/32 + r with |r| <= ln2/64, e^a = 2^m 2^(j/32) e^r.
// The reduction and the leading terms 1 + r are carried in double-double;
// the rest of the series, at most r^2/2 < 6e-5, needs only double precision.
#include "utilities/higher_functions/double_double.h"

#include <cmath>

namespace qel {
namespace {

const DoubleDouble kExp2Table[32] = {
#include "utilities/higher_functions/exp2_table.inc"
};

}  // namespace

DoubleDouble ddExp(DoubleDouble a, int* exponent) {
  constexpr DoubleDouble kLn2By32 = {0.02166084939249829, 7.247021293269686e-19};
  constexpr double kRound = 6755399441055744.0;  // 2^52 + 2^51: rounds to an integer
  const double k = (a.hi * 46.16624130844683 + kRound) - kRound;
  const DoubleDouble r = ddAdd(a, ddMul(kLn2By32, -k));
  const double t = r.hi;
  // e^t - 1 - t to the seventh power; the eighth term is below 5e-21.
  const double p =
      t * t *
      (0.5 + t * (1.0 / 6 + t * (1.0 / 24 + t * (1.0 / 120 + t * (1.0 / 720 + t * (1.0 / 5040))))));
  const DoubleDouble one = ddTwoSum(1.0, t);
  const DoubleDouble er = ddFastTwoSum(one.hi, one.lo + (r.lo + p));
  const int n = static_cast<int>(k);
  const int j = n & 31;
  *exponent = (n - j) / 32;
  return ddMul(kExp2Table[j], er);
}

// y = ln p (double) is within an ulp or so of the truth; Newton's step for
// e^y = p is y + (p e^-y - 1) = y + (p - e^y)/e^y, whose own error is of
// the order of the step squared, 1e-32, beside the 1e-20 of ddExp.
// e^y = s 2^k with s near 1, so that p 2^-k (exact: a change of exponent)
// and s differ by about 1e-16 s and their difference is exact.
DoubleDouble ddLog(double p) {
  const double y = std::log(p);
  int k = 0;
  const DoubleDouble e = ddExp({y, 0.0}, &k);
  const DoubleDouble gap = ddAdd(DoubleDouble{std::ldexp(p, -k), 0.0}, DoubleDouble{-e.hi, -e.lo});
  return ddAdd(DoubleDouble{y, 0.0}, gap.hi / e.hi);
}

}  // namespace qel
