// Checked elementary functions. Kernels call these instead of exp, log and pow
// wherever a bad argument is possible: an argument that would overflow or is
// outside the domain becomes a standard exception (or a stated substitute when
// throwOnError is false), even in a thread that is not armed.
#ifndef QEL_SRC_UTILITIES_CHECKEDFUNCTIONS_H
#define QEL_SRC_UTILITIES_CHECKEDFUNCTIONS_H

namespace qel {

double mSqrt(double x, bool throwOnError);
double mExponential(double x, bool throwOnError);
double mLog(double x, bool throwOnError);
double mLog10(double x, bool throwOnError);
double mRaiseToPower(double base, double power, bool throwOnError);

// Trigonometric functions refuse arguments beyond mGetMaxTrigArg() with
// std::invalid_argument.
double mSin(double x);
double mCos(double x);
double mTan(double x);
double mATan(double x);
// Outside [-1, 1] these answer the missing value.
double mASin(double x);
double mACos(double x);

double mDegreesToRadians(double degrees);
double mRadiansToDegrees(double radians);

}  // namespace qel

#endif
