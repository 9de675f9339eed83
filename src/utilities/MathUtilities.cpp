#include "utilities/MathUtilities.h"

#include <algorithm>
#include <cmath>

#include "utilities/LYNBasicTypes.h"

namespace qel {

bool mApproxEqual(double a, double b, double relative, double absolute) {
  const double difference = std::fabs(a - b);
  return relative * std::fabs(a) >= difference || absolute >= difference;
}

bool mIsIntegerWithinFuzz(double x, double f) {
  return mEqualWithinFuzz(mNearestInteger(x), x, f);
}

bool mIsEven(double x, double f) {
  if (!mIsIntegerWithinFuzz(x, f)) return false;
  const double r = mNearestInteger(x);
  return 2.0 * std::floor(r / 2.0) == r;
}

double mModulo(double a, double b) {
  return std::fmod(a, b);
}

double mTransferSign(double magnitude, double sign) {
  return std::copysign(magnitude, sign);
}

bool L_EQUAL_WITHIN_FUZZ(const double* a, const double* b, const double* f) {
  return mEqualWithinFuzz(*a, *b, *f);
}
int L_COMPARE_WITH_FUZZ(const double* a, const double* b, const double* f) {
  return mCompareWithFuzz(*a, *b, *f);
}
double GET_NEAREST_INTEGER(const double* x) {
  return mNearestInteger(*x);
}
double GET_FLOOR(const double* x) {
  return std::floor(*x);
}
double GET_CEILING(const double* x) {
  return std::ceil(*x);
}
bool LEQUAL(const double* a, const double* b, const double* relative, const double* absolute) {
  return mApproxEqual(*a, *b, *relative, *absolute);
}

}  // namespace qel
