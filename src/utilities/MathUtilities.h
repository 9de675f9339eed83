// Comparison within a tolerance and integer tests on doubles.
//
// With eps = mGetEps(false) = 1e-12 and a scale f, two numbers compare equal
// when |a - b| <= abs(f) + eps * max(|a|, |b|), where abs(f) is 1e-30 for
// f = 0 and 1e-14 * f otherwise. The comparison is inclusive.
#ifndef QEL_SRC_UTILITIES_MATHUTILITIES_H
#define QEL_SRC_UTILITIES_MATHUTILITIES_H

namespace qel {

double mGetFuzzMax(double x);
int mCompareWithFuzz(double a, double b, double f);
bool mEqualWithinFuzz(double a, double b, double f);
// Only |a| scales the relative part: not symmetric in a and b.
bool mApproxEqual(double a, double b, double relative, double absolute);
bool mIsIntegerWithinFuzz(double x, double f);
bool mIsEven(double x, double f);
double mModulo(double a, double b);
// Halves go away from zero.
double mNearestInteger(double x);
// The magnitude's bits with the sign bit of the second argument.
double mTransferSign(double magnitude, double sign);

// Pointer forms used by the older numerical routines.
bool L_EQUAL_WITHIN_FUZZ(const double* a, const double* b, const double* f);
int L_COMPARE_WITH_FUZZ(const double* a, const double* b, const double* f);
double GET_NEAREST_INTEGER(const double* x);
double GET_FLOOR(const double* x);
double GET_CEILING(const double* x);
bool LEQUAL(const double* a, const double* b, const double* relative, const double* absolute);

}  // namespace qel

#endif
