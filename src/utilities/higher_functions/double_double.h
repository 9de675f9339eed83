// Double-double arithmetic: a value is the unevaluated sum hi + lo of two
// doubles with |lo| <= ulp(hi)/2, about 106 bits. The error-free
// transformations are Knuth's TwoSum and Dekker's TwoProduct with
// Veltkamp's split (T. J. Dekker, "A floating-point technique for extending
// the available precision", Numer. Math. 18 (1971) 224-242); no fused
// multiply-add is assumed, so the code is exact on any IEEE double machine.
// Operands stay far from overflow in the callers (the split multiplies by
// 2^27 + 1).
#ifndef QEL_SRC_UTILITIES_HIGHER_FUNCTIONS_DOUBLE_DOUBLE_H
#define QEL_SRC_UTILITIES_HIGHER_FUNCTIONS_DOUBLE_DOUBLE_H

namespace qel {

struct DoubleDouble {
  double hi, lo;
};

inline DoubleDouble ddTwoSum(double a, double b) {
  const double s = a + b;
  const double v = s - a;
  return {s, (a - (s - v)) + (b - v)};
}

inline DoubleDouble ddFastTwoSum(double a, double b) {  // |a| >= |b|
  const double s = a + b;
  return {s, b - (s - a)};
}

inline DoubleDouble ddTwoProduct(double a, double b) {
  constexpr double kSplit = 134217729.0;  // 2^27 + 1
  const double p = a * b;
  const double ca = kSplit * a, cb = kSplit * b;
  const double ah = ca - (ca - a), al = a - ah;
  const double bh = cb - (cb - b), bl = b - bh;
  return {p, ((ah * bh - p) + ah * bl + al * bh) + al * bl};
}

inline DoubleDouble ddAdd(DoubleDouble a, DoubleDouble b) {
  const DoubleDouble s = ddTwoSum(a.hi, b.hi);
  return ddFastTwoSum(s.hi, s.lo + a.lo + b.lo);
}

inline DoubleDouble ddAdd(DoubleDouble a, double b) {
  const DoubleDouble s = ddTwoSum(a.hi, b);
  return ddFastTwoSum(s.hi, s.lo + a.lo);
}

inline DoubleDouble ddMul(DoubleDouble a, DoubleDouble b) {
  const DoubleDouble p = ddTwoProduct(a.hi, b.hi);
  return ddFastTwoSum(p.hi, p.lo + (a.hi * b.lo + a.lo * b.hi));
}

inline DoubleDouble ddMul(DoubleDouble a, double b) {
  const DoubleDouble p = ddTwoProduct(a.hi, b);
  return ddFastTwoSum(p.hi, p.lo + a.lo * b);
}

// a / b by one correction of the double quotient.
inline DoubleDouble ddDiv(DoubleDouble a, DoubleDouble b) {
  const double q = a.hi / b.hi;
  const DoubleDouble r = ddAdd(a, ddMul(b, -q));
  return ddFastTwoSum(q, r.hi / b.hi);
}

// exp(a) = s 2^exponent for a double-double a with -745 < a.hi <= 0, s in
// [0.98, 2) to about 1e-20 relative. The scale is left to the
// caller: a low part below 2^-1022 would be flushed to zero where the
// floating-point state treats subnormal operands as zero.
DoubleDouble ddExp(DoubleDouble a, int* exponent);

// ln p for 2^-1022 <= p <= 1 to about 1e-20 absolute: the double logarithm
// corrected by one Newton step on e^y = p, with e^y from ddExp.
DoubleDouble ddLog(double p);

}  // namespace qel

#endif
