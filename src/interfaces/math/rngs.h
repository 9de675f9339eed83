// The library's one source of randomness: a combined multiplicative
// congruential generator of three prime-modulus streams (the construction of
// Wichmann and Hill, Applied Statistics AS 183, with its own multipliers and
// moduli), and the clock seed.
//
// Streams, each multiplier a primitive root of its prime modulus, so that each
// stream runs through every nonzero residue:
//   x1 <- 157 x1 mod 32363   (period 32362)
//   x2 <- 146 x2 mod 31727   (period 31726)
//   x3 <- 142 x3 mod 31657   (period 31656)
// A draw is the fractional part of x1/32363 + x2/31727 + x3/31657, added left
// to right in doubles; the combined period is lcm(32362, 31726, 31656).
//
// A state is named by a double, its base: the mixed-radix number
// (x1 - 1, x2 - 1, x3 - 1) with radices 32362, 31726, 31656. Any double is
// accepted as a base (sign dropped, reduced modulo the size of the base space,
// fractions ignored), and for integer bases below 32362 * 31726 * 31656
// mGetBase() gives back the base that was set. A host that saves the base can
// thus continue the same stream later, bit for bit.
#ifndef QEL_SRC_INTERFACES_MATH_RNGS_H
#define QEL_SRC_INTERFACES_MATH_RNGS_H

#include <cstdint>

namespace qel {

// Clock seed: seconds * 1e7 + microseconds of gettimeofday, in doubles. The
// factor 1e7 (not 1e6) spreads the clock over the base space.
double Seed();

class CmUniformGenerator {
 public:
  // State from the clock.
  CmUniformGenerator();
  // State from seed; a seed of exactly 0.0 asks for the clock instead.
  explicit CmUniformGenerator(double seed);
  ~CmUniformGenerator() {}

  // Advances the three streams and returns a double in [0, 1).
  double mGetRandom() {
    mFirst = (mFirst * 157) % 32363;
    mSecond = (mSecond * 146) % 31727;
    mThird = (mThird * 142) % 31657;
    // The order of the sum is part of the stream: results repeat bit for bit
    // only if it is kept.
    const double s = static_cast<double>(mFirst) / mFirstModulus +
                     static_cast<double>(mSecond) / mSecondModulus +
                     static_cast<double>(mThird) / mThirdModulus;
    // The fractional part as modf gives it: 0 <= s < 3, so the integer part
    // converts exactly and the difference is exact. Done inline because modf
    // is a library call that would cost as much as the rest of the draw.
    return s - static_cast<double>(static_cast<std::int32_t>(s));
  }

  // New state from the clock.
  void mReset();
  // State named by base (see above).
  void mSetBase(double base);
  // Sets the current state aside (one level only: a second push overwrites
  // it), then takes the state named by base.
  void mPushBase(double base);
  // Back to the state set aside by the last push. Neither operation checks the
  // pushed flag; a pop without a push restores whatever was saved.
  void mPopBase();
  // Base of the current state.
  double mGetBase() const;

 private:
  void mSetState(double base);

  std::int32_t mFirst;
  std::int32_t mSecond;
  std::int32_t mThird;
  std::int32_t mPushed;
  std::int32_t mSavedFirst;
  std::int32_t mSavedSecond;
  std::int32_t mSavedThird;
  double mFirstModulus;
  double mSecondModulus;
  double mThirdModulus;
};

}  // namespace qel

#endif
