// Inner side of the basic types: the numeric constants (stored with exact bit
// patterns), the missing value, integer tests and conversions.
#ifndef QEL_SRC_UTILITIES_LYNBASICTYPES_H
#define QEL_SRC_UTILITIES_LYNBASICTYPES_H

#include <qel/basic_types.h>

#include <cmath>
#include <csignal>
#include <cstdint>
#include <cstring>
#include <vector>

namespace qel {

// Largest argument of exp that cannot overflow: one unit in the last place
// below log(DBL_MAX). Each translation unit has its own copy, set at load time.
static const double MAX_EXPONENT = std::nextafter(709.782712893384, 0.0);
static const double XEXP = std::nextafter(709.782712893384, 0.0);

// The constants read on every call of a distribution function are defined
// here, inline: an out-of-line call per argument check cost more than the
// check. Each is an exact bit pattern, so no decimal conversion moves it.
inline double mDoubleFromBits(std::uint64_t bits) {
  double d;
  std::memcpy(&d, &bits, sizeof d);
  return d;
}

inline double mGetMissingValueCode() {
  return mDoubleFromBits(0x462F2A2831AE5ED5ULL);
}
double mGetUndefinedCode();
double mGetMaxDataValue();
double mGetMaxInteger();
double mGetNearlyZero();
inline double mGetEps(bool newEps = false) {
  return newEps ? mDoubleFromBits(0x3CD0000000000000ULL) : mDoubleFromBits(0x3D719799812DEA11ULL);
}
inline double mGetNewEps() {
  return mDoubleFromBits(0x3CD0000000000000ULL);
}
double mGetMaxTrigArg();
double mGetMaxExponent();
double mGetPi();
double mGetE();
double mGetEulerConst();

// Quiet NaN with the bits 0x7FF8000000000000, the "not available" answer.
inline double mQuietNaN() {
  return mDoubleFromBits(0x7FF8000000000000ULL);
}

// Carries the name of the constants' source; no data, no behaviour.
class CmLYNConst {
 public:
  CmLYNConst();
  ~CmLYNConst();
};

// A quiet comparison: a NaN argument is simply not the missing value.
inline bool mIsNumericMissing(double x) {
  return x == mGetMissingValueCode();
}
bool mIsInteger(double x);
int mToINTG(unsigned int x);
int mToINTG(double x);
unsigned int mToUINTG(double x);
void mToINTG(const std::vector<double>& from, std::vector<int>& to);

EAlternative mAlternativeFromConfidence(EConfidenceType confidence);
EAlternative mAlternativeFromConfidence(int confidence);
EConfidenceType mConfidenceFromAlternative(EAlternative alternative);

double mConvertInfinityAndNaNToMissing(double x);
int mConvertInfinityAndNaNToMissing(std::vector<double>& values);

// SIGFPE handler installed by RegisterLynSigfpeHandler: re-arms the thread
// and throws the standard exception that matches the trap.
void LynSigfpeHandler(int signal, siginfo_t* info, void* context);

}  // namespace qel

#endif
