#include "utilities/LYNBasicTypes.h"

#include <cstring>
#include <limits>

namespace qel {

namespace {

// The constants are defined by their bit patterns so that no decimal
// conversion can move them by an ulp.
double fromBits(std::uint64_t bits) {
  double d;
  std::memcpy(&d, &bits, sizeof d);
  return d;
}

}  // namespace

double mGetUndefinedCode() {
  return fromBits(0xC62F2689C074B614ULL);
}
double mGetMaxDataValue() {
  return fromBits(0x43ABC88864985500ULL);
}
double mGetMaxInteger() {
  return fromBits(0x41DFFE27B0000000ULL);
}
double mGetNearlyZero() {
  return fromBits(0x39B4484BFEEBC2A0ULL);
}
double mGetMaxTrigArg() {
  return fromBits(0x412921FA00000000ULL);
}
double mGetMaxExponent() {
  return MAX_EXPONENT;
}
double mGetPi() {
  return fromBits(0x400921FB54442D18ULL);
}
double mGetE() {
  return fromBits(0x4005BF0A8B145769ULL);
}
double mGetEulerConst() {
  return fromBits(0x3FE2788CFC6FB619ULL);
}
CmLYNConst::CmLYNConst() {}
CmLYNConst::~CmLYNConst() {}

bool IsNaN(double x) {
  return std::isnan(x);
}
bool IsResultNA(double x) {
  return IsNaN(x);
}
bool IsInfinity(double x) {
  return std::isinf(x);
}
bool IsPlusInfinity(double x) {
  return std::isinf(x) && !std::signbit(x);
}
bool IsMinusInfinity(double x) {
  return std::isinf(x) && std::signbit(x);
}

bool mIsInteger(double x) {
  if (std::fabs(x) > mGetMaxInteger()) return false;
  // NaN fails the comparison above only by being unordered: refuse it here so
  // that the conversion below never sees it.
  if (std::isnan(x)) return false;
  return static_cast<double>(static_cast<int>(x)) == x;
}

int mToINTG(unsigned int x) {
  return static_cast<int>(x);
}
int mToINTG(double x) {
  return static_cast<int>(x);
}

unsigned int mToUINTG(double x) {
  // Through 64 bits so that values up to 4294967295 survive the truncation.
  return static_cast<unsigned int>(static_cast<std::int64_t>(x));
}

void mToINTG(const std::vector<double>& from, std::vector<int>& to) {
  to.clear();
  to.reserve(from.size());
  for (double v : from) to.push_back(static_cast<int>(v));
}

EAlternative mAlternativeFromConfidence(int confidence) {
  if (confidence == kConfidenceLowerSide) return kAlternativeGreater;
  if (confidence == kConfidenceUpperSide) return kAlternativeLess;
  return kAlternativeNotEqual;
}

EAlternative mAlternativeFromConfidence(EConfidenceType confidence) {
  return mAlternativeFromConfidence(static_cast<int>(confidence));
}

EConfidenceType mConfidenceFromAlternative(EAlternative alternative) {
  if (alternative == kAlternativeGreater) return kConfidenceLowerSide;
  if (alternative == kAlternativeLess) return kConfidenceUpperSide;
  return kConfidenceTwoSided;
}

double mConvertInfinityAndNaNToMissing(double x) {
  return std::isfinite(x) ? x : mGetMissingValueCode();
}

int mConvertInfinityAndNaNToMissing(std::vector<double>& values) {
  int replaced = 0;
  for (double& v : values) {
    if (!std::isfinite(v)) {
      v = mGetMissingValueCode();
      ++replaced;
    }
  }
  return replaced;
}

}  // namespace qel
