// The combined congruential generator: seeding, the base of a state and the
// one-level save and restore. The draw itself is inline in the header.
#include "interfaces/math/rngs.h"

#include <qel/random.h>
#include <sys/time.h>

#include <cmath>

#include "utilities/MathUtilities.h"

namespace qel {

namespace {

// Moduli less one: the number of states of each stream, and the radices of the
// base.
constexpr double kStates1 = 32362.0;
constexpr double kStates2 = 31726.0;
constexpr double kStates3 = 31656.0;
// Weight of the first state in the base (exact in a double).
constexpr double kWeight1 = kStates2 * kStates3;
// Size of the base space, 32501747400672 (exact in a double).
constexpr double kBaseSpace = kStates1 * kStates2 * kStates3;

}  // namespace

double Seed() {
  timeval now;
  gettimeofday(&now, nullptr);
  return static_cast<double>(now.tv_sec) * 1e7 + static_cast<double>(now.tv_usec);
}

double Seeder() {
  return Seed();
}

// A seed of 0 asks for the clock, so the default generator is that one.
CmUniformGenerator::CmUniformGenerator() : CmUniformGenerator(0.0) {}

CmUniformGenerator::CmUniformGenerator(double seed)
    : mFirst(0),
      mSecond(0),
      mThird(0),
      mPushed(0),
      mSavedFirst(0),
      mSavedSecond(0),
      mSavedThird(0),
      mFirstModulus(32363.0),
      mSecondModulus(31727.0),
      mThirdModulus(31657.0) {
  mSetState(seed == 0.0 ? Seed() : seed);
}

// Mixed-radix digits of |base| reduced modulo the base space. The fraction of
// the base survives the reduction but vanishes in the truncations, so every
// component lands in 1 .. modulus - 1 and is never zero, whatever the base.
void CmUniformGenerator::mSetState(double base) {
  // A base with no finite remainder names no state; rather than convert NaN
  // to an integer (which traps in an armed thread) it is read as base 0.
  // fmod of an infinity would raise the invalid operation inside libm.
  double b = 0.0;
  if (std::isfinite(base)) b = mModulo(std::fabs(base), kBaseSpace);
  mFirst = static_cast<std::int32_t>(b / kWeight1) + 1;
  mSecond = static_cast<std::int32_t>(mModulo(b / kStates3, kStates2)) + 1;
  mThird = static_cast<std::int32_t>(mModulo(b, kStates3)) + 1;
}

void CmUniformGenerator::mReset() {
  mSetState(Seed());
}

void CmUniformGenerator::mSetBase(double base) {
  mSetState(base);
}

void CmUniformGenerator::mPushBase(double base) {
  mPushed = 1;
  mSavedFirst = mFirst;
  mSavedSecond = mSecond;
  mSavedThird = mThird;
  mSetState(base);
}

void CmUniformGenerator::mPopBase() {
  mPushed = 0;
  mFirst = mSavedFirst;
  mSecond = mSavedSecond;
  mThird = mSavedThird;
}

double CmUniformGenerator::mGetBase() const {
  return (mThird - 1.0) + kStates3 * ((mSecond - 1.0) + kStates2 * (mFirst - 1.0));
}

}  // namespace qel
