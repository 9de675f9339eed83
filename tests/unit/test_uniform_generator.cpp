// The combined congruential generator: streams bit for bit against an
// independent implementation of the same arithmetic
// (tools/reference/gen_uniform_stream.py), the seed space, the one-level save
// and restore, the period of each stream, the clock seed, and a statistical
// sanity check of the output.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/random.h>
#include <sys/time.h>

#include <cmath>
#include <cstdint>
#include <cstring>
#include <limits>
#include <vector>

#include "interfaces/math/rngs.h"
#include "reference_data.h"

namespace {

using qel::CmUniformGenerator;

constexpr double kBaseSpace = 32501747400672.0;

struct State {
  std::int64_t first, second, third;
};

// The mixed-radix digits of a base (exact: bases are integers below 2^45).
State decode(double base) {
  const auto b = static_cast<std::int64_t>(base);
  return {b / (31726LL * 31656LL) + 1, (b / 31656LL) % 31726LL + 1, b % 31656LL + 1};
}

std::uint64_t bits(double x) {
  std::uint64_t out;
  std::memcpy(&out, &x, sizeof out);
  return out;
}

std::vector<double> draws(CmUniformGenerator& generator, int count) {
  std::vector<double> out(count);
  for (double& x : out) x = generator.mGetRandom();
  return out;
}

TEST(UniformGenerator, StreamsMatchIndependentArithmeticBitForBit) {
  const auto rows = qeltest::loadReferenceData("uniform_stream.csv", 1);
  int streams = 0, deep = 0;
  for (const auto& row : rows) {
    const auto& n = row.numbers;
    SCOPED_TRACE("line " + std::to_string(row.line));
    if (row.text[0] == "stream") {
      ++streams;
      const double seed = n[0];
      CmUniformGenerator generator(seed);
      const State state = decode(generator.mGetBase());
      EXPECT_EQ(state.first, n[1]);
      EXPECT_EQ(state.second, n[2]);
      EXPECT_EQ(state.third, n[3]);
      EXPECT_EQ(generator.mGetBase(), n[4]);
      // mSetBase on a clock-seeded object reaches the same state.
      CmUniformGenerator reseeded;
      reseeded.mSetBase(seed);
      for (std::size_t i = 5; i < n.size(); ++i) {
        const double x = generator.mGetRandom();
        ASSERT_EQ(bits(x), bits(n[i])) << "draw " << i - 4 << " after seed " << seed;
        ASSERT_EQ(bits(reseeded.mGetRandom()), bits(x));
      }
    } else if (row.text[0] == "deep") {
      ++deep;
      CmUniformGenerator generator(n[0]);
      const auto k = static_cast<long>(n[1]);
      double x = 0.0;
      for (long i = 0; i < k; ++i) x = generator.mGetRandom();
      EXPECT_EQ(bits(x), bits(n[2])) << "draw " << k << " after seed " << n[0];
      EXPECT_EQ(generator.mGetBase(), n[3]);
    }
  }
  EXPECT_GE(streams, 10);
  EXPECT_GE(deep, 6);
}

// Beyond the stream rows (seeds 1 and -1, fractions, the size of the space,
// digit boundaries, reduction): more seeds that give the state (1, 1, 1), and
// bases set directly, which come back unchanged below the size of the space
// and reduced above it.
TEST(UniformGenerator, SeedSpaceEdges) {
  for (double seed : {0.999999, -0.25, 2.0 * kBaseSpace}) {
    CmUniformGenerator generator(seed);
    EXPECT_EQ(generator.mGetBase(), 0.0) << seed;
  }
  CmUniformGenerator generator(1.0);
  for (double base : {0.0, 1.0, 31655.0, 31656.0, 1004318255.0, 1004318256.0, kBaseSpace - 1.0,
                      4503599627370.0, 12345678901234.0}) {
    generator.mSetBase(base);
    EXPECT_EQ(generator.mGetBase(), base);
  }
  generator.mSetBase(kBaseSpace + 77.0);
  EXPECT_EQ(generator.mGetBase(), 77.0);
  generator.mSetBase(123.75);
  EXPECT_EQ(generator.mGetBase(), 123.0);
}

TEST(UniformGenerator, NonFiniteBaseNeitherTrapsNorLeavesTheRanges) {
  const double inf = std::numeric_limits<double>::infinity();
  const double nan = std::numeric_limits<double>::quiet_NaN();
  qel::SetLynFpuStates();
  CmUniformGenerator fromInfinity(inf), fromNaN(nan);
  CmUniformGenerator generator(5.0);
  generator.mSetBase(-inf);
  const double base = generator.mGetBase();
  const double x = generator.mGetRandom();
  qel::ResetFpuStates();
  // Such a base names no state; it is read as base 0.
  EXPECT_EQ(fromInfinity.mGetBase(), 0.0);
  EXPECT_EQ(fromNaN.mGetBase(), 0.0);
  EXPECT_EQ(base, 0.0);
  EXPECT_TRUE(x >= 0.0 && x < 1.0);
}

TEST(UniformGenerator, PushAndPopRestoreTheStream) {
  CmUniformGenerator reference(2024.0), generator(2024.0);
  const std::vector<double> expected = draws(reference, 40);
  std::vector<double> got = draws(generator, 10);
  generator.mPushBase(555.0);
  CmUniformGenerator side(555.0);
  EXPECT_EQ(draws(generator, 500), draws(side, 500));
  generator.mPopBase();
  for (double x : draws(generator, 30)) got.push_back(x);
  EXPECT_EQ(got, expected);

  // One level only: a second push overwrites the saved state.
  CmUniformGenerator twice(31.0);
  twice.mPushBase(1000.0);
  twice.mPushBase(2000.0);
  twice.mPopBase();
  EXPECT_EQ(twice.mGetBase(), 1000.0);
  // The flag is not tested: a second pop restores the same saved state again.
  twice.mGetRandom();
  twice.mPopBase();
  EXPECT_EQ(twice.mGetBase(), 1000.0);
}

TEST(UniformGenerator, EachStreamRunsThroughItsFullCycle) {
  // From base 0 (states 1, 1, 1) every component must stay in its range and
  // return to 1 first after exactly the order of its multiplier.
  CmUniformGenerator generator(kBaseSpace);
  std::int64_t firstReturn[3] = {0, 0, 0};
  for (std::int64_t step = 1; step <= 32362; ++step) {
    const double x = generator.mGetRandom();
    ASSERT_TRUE(x >= 0.0 && x < 1.0) << step;
    const State s = decode(generator.mGetBase());
    ASSERT_TRUE(s.first >= 1 && s.first <= 32362) << step;
    ASSERT_TRUE(s.second >= 1 && s.second <= 31726) << step;
    ASSERT_TRUE(s.third >= 1 && s.third <= 31656) << step;
    const std::int64_t digits[3] = {s.first, s.second, s.third};
    for (int k = 0; k < 3; ++k) {
      if (digits[k] == 1 && firstReturn[k] == 0) firstReturn[k] = step;
    }
  }
  EXPECT_EQ(firstReturn[0], 32362);
  EXPECT_EQ(firstReturn[1], 31726);
  EXPECT_EQ(firstReturn[2], 31656);
}

double clockNow() {
  timeval now;
  gettimeofday(&now, nullptr);
  return static_cast<double>(now.tv_sec) * 1e7 + static_cast<double>(now.tv_usec);
}

TEST(UniformGenerator, ClockSeed) {
  // Seconds * 1e7 + microseconds: bracketed by two readings of the clock.
  const double before = clockNow();
  const double seed = qel::Seed();
  const double exported = qel::Seeder();
  const double after = clockNow();
  EXPECT_LE(before, seed);
  EXPECT_LE(seed, exported);
  EXPECT_LE(exported, after);
  EXPECT_GT(seed, 1.5e16);  // a 1e6 factor would give about 1.7e15 today

  // A seed of exactly zero asks for the clock, and so does mReset: the base
  // lies between the reduced readings (unless the clock wrapped the space).
  auto within = [](double base, double from, double to) {
    const double lo = std::floor(std::fmod(from, kBaseSpace));
    const double hi = std::fmod(to, kBaseSpace);
    return lo > hi || (base >= lo && base <= hi);
  };
  double from = clockNow();
  CmUniformGenerator clocked(0.0);
  EXPECT_TRUE(within(clocked.mGetBase(), from, clockNow()));
  CmUniformGenerator byDefault;
  from = clockNow();
  byDefault.mReset();
  EXPECT_TRUE(within(byDefault.mGetBase(), from, clockNow()));
}

TEST(UniformGenerator, OutputIsUniformAndSeriallyIndependent) {
  const auto rows = qeltest::loadReferenceData("uniform_stream.csv", 1);
  double critical = 0.0;
  for (const auto& row : rows) {
    if (row.text[0] == "chisq") critical = row.numbers[2];
  }
  ASSERT_GT(critical, 0.0);

  constexpr int n = 1000000;
  CmUniformGenerator generator(20261123.0);
  double sum = 0.0, sumSquares = 0.0;
  std::vector<double> buckets(100, 0.0), pairs(100, 0.0);
  int previous = -1;
  for (int i = 0; i < n; ++i) {
    const double x = generator.mGetRandom();
    ASSERT_TRUE(x >= 0.0 && x < 1.0);
    sum += x;
    sumSquares += x * x;
    buckets[static_cast<int>(x * 100.0)] += 1.0;
    const int decile = static_cast<int>(x * 10.0);
    if (i % 2 == 1) pairs[previous * 10 + decile] += 1.0;
    previous = decile;
  }
  const double mean = sum / n;
  const double variance = sumSquares / n - mean * mean;
  // Five standard errors: sqrt(1/12/n) for the mean and
  // sqrt((1/80 - 1/144)/n) for the variance.
  EXPECT_NEAR(mean, 0.5, 5.0 * std::sqrt(1.0 / 12.0 / n));
  EXPECT_NEAR(variance, 1.0 / 12.0, 5.0 * std::sqrt((1.0 / 80.0 - 1.0 / 144.0) / n));

  auto chiSquare = [](const std::vector<double>& counts, double total) {
    const double expected = total / counts.size();
    double statistic = 0.0;
    for (double c : counts) statistic += (c - expected) * (c - expected) / expected;
    return statistic;
  };
  EXPECT_LT(chiSquare(buckets, n), critical);
  EXPECT_LT(chiSquare(pairs, n / 2), critical);
}

}  // namespace
