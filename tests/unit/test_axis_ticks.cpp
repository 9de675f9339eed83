// The axis tick search: its small functions, cases worked by hand from the
// rules, properties over random ranges and bad input.
#include <gtest/gtest.h>

#include <cfloat>
#include <cmath>
#include <limits>
#include <random>
#include <vector>

#include "nms/binning/gscale.h"

namespace {

using namespace qel::deprecated;
constexpr double kNone = DBL_MAX;

TickCalculationResult ticks(double lo, double hi, double lowerLimit = -kNone,
                            double upperLimit = kNone, int minTicks = 4, int maxTicks = 11,
                            double belowMax = 0.05, double aboveMax = 0.05,
                            double tickMargin = 0.5) {
  TickCalculationResult r;
  ComputeTicks(&r, minTicks, maxTicks, 0, belowMax, 0, aboveMax, lowerLimit, upperLimit, tickMargin,
               tickMargin, lo, hi);
  return r;
}

void expectResult(const TickCalculationResult& r, double first, double last, double smin,
                  double smax, double inc, int n) {
  const double tol = 1e-12 * (std::fabs(smax) + std::fabs(smin));
  EXPECT_TRUE(std::fabs(r.firstTick - first) <= tol && std::fabs(r.lastTick - last) <= tol &&
              std::fabs(r.scaleMinimum - smin) <= tol && std::fabs(r.scaleMaximum - smax) <= tol &&
              std::fabs(r.increment - inc) <= tol && r.tickCount == n)
      << r.firstTick << " " << r.lastTick << " " << r.scaleMinimum << " " << r.scaleMaximum << " "
      << r.increment << " " << r.tickCount;
}

TEST(AxisTicks, SmallFunctions) {
  // round is a truncation.
  EXPECT_TRUE(qel::deprecated::round(74.6699, 3) == 74.669 &&
              qel::deprecated::round(-1.23456, 2) == -1.23 && qel::deprecated::round(0, 5) == 0);
  EXPECT_TRUE(EqualWithFuzz(1e6, 1e6 + 1e-7, 1e-12) && !EqualWithFuzz(1, 1 + 1e-11, 1e-12));
  EXPECT_TRUE(ComputeNearestInteger(2.5) == 3 && ComputeNearestInteger(-2.5) == -3);
  EXPECT_TRUE(ComputePower(999.99) == 2 && ComputePower(-0.001) == -3 && ComputePower(1e-31) == 0);
  // {value, roundUp, nice, exponent, index}
  const double nice[][5] = {{7.3, 1, 8, -1, 9},     {7.3, 0, 6, -1, 8},   {85, 1, 100, 1, 0},
                            {85, 0, 80, 0, 9},      {-7.3, 1, -6, -1, 8}, {-7.3, 0, -8, -1, 9},
                            {0.25, 1, 0.25, -2, 4}, {1e-13, 1, 0, 0, 0}};
  for (const auto& c : nice) {
    double v;
    int e, i;
    GetClosestNiceNumber(c[0], adNiceIncValsArray, 10, c[1] != 0, v, e, i);
    EXPECT_TRUE(std::fabs(v - c[2]) <= 1e-15 * std::fabs(c[2]) && e == c[3] && i == c[4]) << c[0];
  }
  // Two first ticks gain their midpoint, group 5.
  std::vector<double> t;
  std::vector<int> g;
  ASSERT_TRUE(FindNiceFirstTicks(0.5, 2.5, aiNiceTickMinGrpsArray, 0, t, g));
  EXPECT_TRUE(t == (std::vector<double>{1, 1.5, 2}) && g == (std::vector<int>{7, 5, 5}));
  // A count of 12 or more always has the full count penalty.
  EXPECT_TRUE(ComputeTickCountPenalty(12) == 1 && ComputeTickCountPenalty(11) == 0.5);
}

// Searches by hand without range margins, 2 to 11 ticks: {m, M, tick
// margin}, the candidate lists, and the winner {s, S, f, t, i} (NaN: none).
struct Hand {
  double m, M, tickMargin;
  std::vector<double> inc;
  std::vector<int> incGroups;
  std::vector<double> first;
  std::vector<int> firstGroups;
  double lowestFirst, highestFirst, win[5];
};

TEST(AxisTicks, ScoresWorkedByHand) {
  const double none = std::nan("");
  const Hand cases[] = {
      // Zero tick: data -2.5 .. 7.5, no range margins, tick margins 1.
      // i 2.5, f -3: ticks -3 .. 7 (n 5) miss 0 (p7) and -3/2.5 is no integer
      // (p9). i 2.5, f -2.5, n 5: t 7.5, zero tick, score (2/7 + 4/7)*10000/3.
      // i 5, f -3: s -3 < a keeps the bounds [-2.5, 0] of the candidate before
      // and is skipped; i 5, f -2.5: ticks -2.5, 2.5, 7.5 miss 0: p7.
      {-2.5, 7.5, 1, {2.5, 5}, {4, 2}, {-3, -2.5}, {7, 2}, -5, 0, {-2.5, 7.5, -2.5, 7.5, 2.5}},
      // Multiples: data 1 .. 9 (p7 = 1 throughout). i 2, f 0.5 (below a = 1:
      // initial bounds [0, 2] carry): t 8.5, n 5, but 0.5/2 is no integer,
      // p9 = 1. i 2, f 2: s 1, bounds [1, 3], t 8 (n 4, last tick within 1 of
      // S = 9): p9 = 0 wins despite the uglier digit (5/7 against 2/7).
      // i 4: f 0.5 falls outside the carried bounds [1, 3]; f 2: n 2, t 6,
      // 2/4 is no integer.
      {1, 9, 1, {2, 4}, {3, 5}, {0.5, 2}, {2, 5}, 0, 2, {1, 9, 2, 8, 2}},
      // Tie: data 0 .. 24, f 0, i 4 (n 7) and i 6 (n 5) both end at 24 with
      // equal groups 5: scores equal, the earlier increment stays.
      {0, 24, 0, {4, 6}, {5, 5}, {0}, {1}, 0, 0, {0, 24, 0, 24, 4}},
      {0, 24, 0, {6, 4}, {5, 5}, {0}, {1}, 0, 0, {0, 24, 0, 24, 6}},
      // Single increment 5 on 0 .. 12, no margins: every last tick from 15 up
      // overshoots d = 12 (p10 = 1) but stays; n 5 (t 20) beats n 4 (t 15)
      // by its count penalty 0 against 0.5.
      {0, 12, 0, {5}, {2}, {0}, {1}, 0, 0, {0, 20, 0, 20, 5}},
      // With two increments the overshoot is skipped, and 7 fits no count.
      {0, 12, 0, {5, 7}, {2, 5}, {0}, {1}, 0, 0, {none}},
  };
  for (const auto& h : cases) {
    const TickSearch s{h.m,          h.M,          0, 0, 0, 0, -INFINITY, INFINITY,
                       h.tickMargin, h.tickMargin, 2, 11};
    TickChoice c{};
    const bool found = FindHighestNicenessScore(h.inc, h.incGroups, h.first, h.firstGroups, s,
                                                h.lowestFirst, h.highestFirst, c);
    ASSERT_EQ(found, !std::isnan(h.win[0])) << h.m << " " << h.M;
    if (!found) continue;
    EXPECT_TRUE(c.scaleMinimum == h.win[0] && c.scaleMaximum == h.win[1] &&
                c.firstTick == h.win[2] && c.lastTick == h.win[3] && c.increment == h.win[4])
        << h.m << " " << h.M;
  }
}

TEST(AxisTicks, WholeSearchesWorkedByHand) {
  // 0.3 .. 9.7, margins 0 .. 0.05, tick margins 0.5, 4 to 11 ticks. P = -1:
  // m 3, M 97, a -1.7, b 3, c 97, d 101.7; increments 10 .. 30, first ticks
  // 0, 10, 20. i 20, f 0, n 6 (t 100): p6 3/7, p8 0, score 1e8 + 1428.9
  // beats i 10 (n 11: p8 0.5, 2142.9) and the rest. Breathing room 2% of 94
  // each side, rounded to 2 digits: -1.88 .. 101.88.
  expectResult(ticks(0.3, 9.7), 0, 10, -0.188, 10.188, 2, 6);
  // The same a thousand decades up and down.
  expectResult(ticks(0.3e300, 9.7e300), 0, 1e301, -0.188e300, 10.188e300, 2e300, 6);
  expectResult(ticks(0.3e-290, 9.7e-290), 0, 1e-289, -0.188e-290, 10.188e-290, 2e-290, 6);
  // A lower limit of 0.5 clips the ticks: first ticks 10, 15 (midpoint), 20
  // within [max(3, 5), 3 + 0.5 i]. i 20, f 10, n 5 (t 90): p9 1 and 1e6 +
  // (1 + 3/7)*10000/3 beats i 15 (t 100, p6 6/7) and i 25 (p8 0.5). 7% of
  // room at each end: no breathing room, the scale is the data.
  expectResult(ticks(0.3, 9.7, 0.5), 1, 9, 0.3, 9.7, 2, 5);
  // Equal data widen by half a unit; all-zero data become -0.5 .. 0.5;
  // -100 .. 1 is solved mirrored and comes back oriented.
  const TickCalculationResult five = ticks(5, 5), zero = ticks(0, 0), m = ticks(-100, 1);
  EXPECT_TRUE(five.firstTick == 4.5 && five.lastTick == 5.5 && zero.firstTick == -0.5 &&
              zero.lastTick == 0.5 && m.firstTick == -100 && m.lastTick == 0 &&
              m.scaleMinimum < -100 && !std::signbit(m.lastTick));
}

struct Args {
  int minTicks, maxTicks;
  double bMin, bMax, aMin, aMax, lowTm, highTm, lo, hi;
  TickCalculationResult run() const {
    TickCalculationResult r;
    ComputeTicks(&r, minTicks, maxTicks, bMin, bMax, aMin, aMax, -kNone, kNone, lowTm, highTm, lo,
                 hi);
    return r;
  }
};

bool niceIncrement(double inc) {
  const double mantissa = inc / std::pow(10.0, std::floor(std::log10(inc))) * 10;
  // A table entry, or the single candidate k*10^e of a gap in the table.
  return std::fabs(mantissa - std::nearbyint(mantissa)) <= 1e-9 * mantissa;
}

TEST(AxisTicks, PropertiesOverRandomRanges) {
  std::mt19937_64 gen(2929);
  std::uniform_real_distribution<double> u(0, 1);
  for (int trial = 0; trial < 100000; ++trial) {
    const double mag = std::pow(10.0, -10 + 310 * u(gen)) * (u(gen) < 0.5 ? -1 : 1);
    const double lo = mag * (0.05 + u(gen)),
                 width = std::fabs(mag) * std::pow(10, -6 + 6.5 * u(gen));
    Args a{2 + int(5 * u(gen)), 0,      0,      0.2 * u(gen), 0,
           0.2 * u(gen),        u(gen), u(gen), lo,           lo + width};
    a.maxTicks = a.minTicks + int(12 * u(gen));
    a.bMin = u(gen) < 0.3 ? a.bMax : u(gen) * a.bMax;
    a.aMin = u(gen) < 0.3 ? a.aMax : u(gen) * a.aMax;
    if (trial % 4 == 0) a.lowTm = a.highTm = 0;
    // The usual arguments always find a nice axis.
    const bool usual = trial % 4 == 1;
    if (usual) a = Args{4, 11, 0, 0.05, 0, 0.05, 0.5, 0.5, a.lo, a.hi};
    const TickCalculationResult r = a.run();
    const double range = r.scaleMaximum - r.scaleMinimum;
    // Denormalising rounds each end to its own last bit.
    const double tol = 1e-12 * range + 4 * DBL_EPSILON * std::fabs(r.scaleMaximum - range / 2);
    ASSERT_TRUE(r.scaleMinimum <= a.lo && a.hi <= r.scaleMaximum) << trial;
    ASSERT_TRUE(r.scaleMinimum <= r.firstTick && r.lastTick <= r.scaleMaximum) << trial;
    ASSERT_NEAR(r.firstTick + (r.tickCount - 1) * r.increment, r.lastTick, tol) << trial;
    // The plain scale of a search without candidates has minTicks ticks and
    // any increment; otherwise the increment is nice and the count allowed.
    const bool nice = niceIncrement(r.increment);
    ASSERT_TRUE(nice || (!usual && r.tickCount == a.minTicks)) << trial;
    ASSERT_TRUE(r.tickCount >= a.minTicks && r.tickCount <= a.maxTicks) << trial;
    if (a.lowTm == 0) {
      ASSERT_TRUE(r.firstTick <= a.lo + tol && r.lastTick >= a.hi - tol) << trial;
    }
    // Mirror image and a change of decade give the same axis.
    const TickCalculationResult m = Args{a.minTicks, a.maxTicks, a.aMin,  a.aMax, a.bMin,
                                         a.bMax,     a.highTm,   a.lowTm, -a.hi,  -a.lo}
                                        .run();
    auto near = [&](double x, double y, double f) { return std::fabs(x - y * f) <= tol * f; };
    ASSERT_TRUE(near(m.firstTick, -r.lastTick, 1) && near(m.scaleMinimum, -r.scaleMaximum, 1) &&
                near(m.scaleMaximum, -r.scaleMinimum, 1))
        << trial;
    // The degenerate-range test has an absolute part (1e-14): a change of
    // decade keeps the axis where both ranges stay clear of it.
    if (width < 1e-11) continue;
    const int j = int(std::fabs(mag) < 1e290 ? 1 + 5 * u(gen) : -3);
    const double f = std::pow(10.0, j);
    Args scaled = a;
    scaled.lo *= f;
    scaled.hi *= f;
    const TickCalculationResult s = scaled.run();
    ASSERT_TRUE(near(s.firstTick, r.firstTick, f) && near(s.scaleMinimum, r.scaleMinimum, f) &&
                near(s.scaleMaximum, r.scaleMaximum, f) && s.tickCount == r.tickCount)
        << trial;
  }
}

TEST(AxisTicks, BadInputHasADefinedResult) {
  const double nan = std::nan("");
  // NaN or infinite data: the constructor's result.
  for (double bad : {nan, double(INFINITY), -double(INFINITY)}) {
    const TickCalculationResult r = ticks(bad, 1);
    EXPECT_TRUE(std::isnan(r.firstTick) && std::isnan(r.increment) && r.tickCount == 0);
  }
  const TickCalculationResult good = ticks(0.3, 9.7);
  auto same = [&](const TickCalculationResult& r) {
    return r.firstTick == good.firstTick && r.lastTick == good.lastTick &&
           r.scaleMinimum == good.scaleMinimum && r.scaleMaximum == good.scaleMaximum &&
           r.tickCount == good.tickCount;
  };
  TickCalculationResult r, q;
  // Swapped data, swapped or negative margins, swapped limits, and limits
  // that exclude the data are repaired into the plain problem.
  ComputeTicks(&r, 4, 11, 0.05, 0, 0.05, 0, -kNone, kNone, 0.5, 0.5, 0.3, 9.7);
  ComputeTicks(&q, 4, 11, -1, 0.05, -2, 0.05, kNone, -kNone, 0.5, 0.5, 0.3, 9.7);
  EXPECT_TRUE(same(ticks(9.7, 0.3)) && same(r) && same(q) && same(ticks(0.3, 9.7, 20, 30)) &&
              same(ticks(0.3, 9.7, -INFINITY, -5)) && same(ticks(0.3, 9.7, nan, nan)));
  // Tick counts: minTicks 0 and 1 count as 2; maxTicks below minTicks as
  // minTicks; a million as 1000, in bounded time.
  for (int minTicks : {0, 1, -5})
    EXPECT_EQ(ticks(0.3, 9.7, -kNone, kNone, minTicks, 11).tickCount, 6) << minTicks;
  r = ticks(0.3, 9.7, -kNone, kNone, 4, 1000000);
  EXPECT_TRUE(ticks(0.3, 9.7, -kNone, kNone, 6, 2).tickCount == 6 && r.tickCount >= 4 &&
              r.tickCount <= 1000);
  // Equal data that may not widen: one tick; tiny unequal data keep their
  // range.
  ComputeTicks(&r, 4, 11, 0, 0, 0, 0, -kNone, kNone, 0.5, 0.5, 3, 3);
  expectResult(r, 3, 3, 3, 3, 0, 1);
  r = ticks(1e-14, 4e-14);
  EXPECT_TRUE(r.scaleMinimum <= 1e-14 && r.scaleMaximum >= 4e-14 && r.scaleMaximum < 1e-13);
  // A scale maximum that truncation would cut to 74.669 is kept at 74.67.
  EXPECT_GE(ticks(3, 74.67, -kNone, kNone, 4, 11, 0.05, 0.05, 0.5).scaleMaximum, 74.67);
}

}  // namespace
