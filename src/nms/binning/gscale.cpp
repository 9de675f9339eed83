// Axis scaling: the nice-number search for tick marks and the scale extent.
#include "nms/binning/gscale.h"

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <limits>
#include <utility>

namespace qel {
namespace deprecated {

const double adNiceIncValsArray[10] = {10, 12, 15, 20, 25, 30, 40, 50, 60, 80};
const int aiNiceIncGrpsArray[10] = {1, 7, 6, 3, 4, 6, 5, 2, 5, 5};
const int aiNiceTickMinGrpsArray[10] = {1, 7, 5, 7, 5, 2, 5, 7, 5, 7};
const int aiNiceTickCountsArray[11] = {10, 10, 10, 5, 0, 0, 0, 0, 0, 0, 5};
const double LynScaleMaxNumberOfTicks = 11.0;

namespace {

constexpr double kInf = std::numeric_limits<double>::infinity();
constexpr int kTickCountCap = 1000;
// More first-tick candidates than this coarsen their spacing by tens.
constexpr double kFirstTickCap = 1e5;

// 10^p, exact for |p| <= 22.
double tenTo(int p) {
  static const double exact[] = {1e0,  1e1,  1e2,  1e3,  1e4,  1e5,  1e6,  1e7,
                                 1e8,  1e9,  1e10, 1e11, 1e12, 1e13, 1e14, 1e15,
                                 1e16, 1e17, 1e18, 1e19, 1e20, 1e21, 1e22};
  if (p >= 0 && p <= 22) return exact[p];
  return std::pow(10.0, static_cast<double>(std::max(-400, std::min(400, p))));
}

// x*10^p; a negative power divides by the exact 10^-p, so that a decimal
// such as 3*10^-1 comes out as the double nearest 0.3. Powers beyond the
// double range go in steps.
double scaleBy(double x, int p) {
  while (p > 300) {
    x *= 1e300;
    p -= 300;
  }
  while (p < -300) {
    x /= 1e300;
    p += 300;
  }
  return p >= 0 ? x * tenTo(p) : x / tenTo(-p);
}

// The decimal exponent of |x| > 0, without the 1e-30 floor of ComputePower.
int decimalExponent(double x) {
  const double a = std::fabs(x);
  int p = static_cast<int>(std::floor(std::log10(a)));
  if (scaleBy(1.0, p) > a) --p;
  if (scaleBy(1.0, p + 1) <= a) ++p;
  return p;
}

bool isNoLimit(double x) {
  return !(std::fabs(x) < DBL_MAX);
}

// y rounded outward to an integer (down for a scale minimum, up for a
// maximum), a value within 1e-9 of an integer counting as that integer.
double outwardInteger(double y, bool down) {
  const double nearest = std::nearbyint(y);
  if (std::fabs(y - nearest) <= 1e-9 * std::max(1.0, std::fabs(y))) return nearest;
  return down ? std::floor(y) : std::ceil(y);
}

// A scale end rounded to the given decimal digits without cutting into the
// scale: the truncation of round() where it moves outward, outward rounding
// where the truncation would move the end inward.
double roundScaleEnd(double x, int digits, bool isMinimum) {
  const double truncated = deprecated::round(x, digits);
  if (isMinimum ? truncated <= x : truncated >= x) return truncated;
  const double p = tenTo(digits);
  return outwardInteger(x * p, isMinimum) / p;
}

// Within the doubles, and without a negative zero (a mirrored 0 tick).
double clampToRange(double x) {
  return std::max(-DBL_MAX, std::min(DBL_MAX, x)) + 0.0;
}

}  // namespace

TickCalculationResult::TickCalculationResult()
    : firstTick(std::numeric_limits<double>::quiet_NaN()),
      lastTick(std::numeric_limits<double>::quiet_NaN()),
      scaleMinimum(std::numeric_limits<double>::quiet_NaN()),
      scaleMaximum(std::numeric_limits<double>::quiet_NaN()),
      increment(std::numeric_limits<double>::quiet_NaN()),
      tickCount(0) {}

double round(double x, int digits) {
  if (x == 0.0) return 0.0;
  const double p = tenTo(digits);
  const double y = x * p;
  return (y < 0.0 ? std::ceil(y) : std::floor(y)) / p;
}

bool EqualWithFuzz(double a, double b, double fuzz) {
  const double diff = std::fabs(a - b);
  return diff <= fuzz || diff <= fuzz * (std::fabs(a) + std::fabs(b)) * 0.5;
}

double ComputeNearestInteger(double x) {
  return x >= 0.0 ? std::floor(x + 0.5) : std::ceil(x - 0.5);
}

int ComputePower(double x) {
  if (!(std::fabs(x) >= 1e-30) || std::isinf(x)) return 0;
  return decimalExponent(x);
}

void GetClosestNiceNumber(double x, const double* table, int size, bool roundUp, double& nice,
                          int& exponent, int& index) {
  nice = 0.0;
  exponent = 0;
  index = 0;
  if (!(std::fabs(x) >= 1e-12) || std::isinf(x)) return;
  const bool negative = x < 0.0;
  // Mantissa in [10, 100).
  int e = decimalExponent(x) - 1;
  const double mantissa = std::fabs(scaleBy(x, -e));
  // Rounding up a negative number shrinks its magnitude.
  const bool magnitudeUp = roundUp != negative;
  int i = 0;
  for (int j = size - 1; j >= 0; --j) {
    if (EqualWithFuzz(table[j], mantissa, 1e-12)) {
      i = j;
      break;
    }
    if (table[j] < mantissa) {
      i = magnitudeUp ? j + 1 : j;
      break;
    }
  }
  if (i == size) {
    i = 0;
    ++e;
  }
  exponent = e;
  index = i;
  nice = scaleBy(negative ? -table[i] : table[i], e);
}

bool FindSetOfNiceNumbers(double smallest, double largest, const double* table, const int* groups,
                          int size, std::vector<double>& increments, std::vector<int>& incGroups) {
  increments.clear();
  incGroups.clear();
  double low = 0.0, high = 0.0;
  int e1 = 0, i1 = 0, e2 = 0, i2 = 0;
  GetClosestNiceNumber(smallest, table, size, true, low, e1, i1);
  GetClosestNiceNumber(largest, table, size, false, high, e2, i2);
  if (low == 0.0) {
    e1 = e2 - 1;
    i1 = 0;
  }
  const long count =
      e1 == e2 ? static_cast<long>(i2) - i1 + 1
               : static_cast<long>(size - i1) + static_cast<long>(e2 - e1 - 1) * size + i2 + 1;
  if (count < 1) {
    // No nice number between: the first multiple of the lower unit that
    // reaches the smallest increment.
    double k = std::max(1.0, std::ceil(scaleBy(smallest, -e2)));
    if (scaleBy(k, e2) < smallest) k += 1.0;
    increments.push_back(scaleBy(k, e2));
    incGroups.push_back(groups[0]);
    return true;
  }
  int e = e1, i = i1;
  for (long n = 0; n < count; ++n) {
    increments.push_back(scaleBy(table[i], e));
    incGroups.push_back(groups[i]);
    if (++i == size) {
      i = 0;
      ++e;
    }
  }
  return !increments.empty();
}

bool FindNiceFirstTicks(double low, double high, const int* minGroups, int power,
                        std::vector<double>& ticks, std::vector<int>& tickGroups) {
  ticks.clear();
  tickGroups.clear();
  if (!(low <= high)) return false;
  double jLow = std::ceil(scaleBy(low, -power));
  double jHigh = std::floor(scaleBy(high, -power));
  // A pathologically wide window (huge margins) is searched on a coarser
  // spacing, which bounds the work of a call.
  while (jHigh - jLow + 1.0 > kFirstTickCap) {
    ++power;
    jLow = std::ceil(scaleBy(low, -power));
    jHigh = std::floor(scaleBy(high, -power));
  }
  const double count = jHigh - jLow + 1.0;
  if (!(count >= 1.0)) return false;
  for (double j = jLow; j <= jHigh; j += 1.0) {
    const double tick = scaleBy(j, power);
    ticks.push_back(tick == 0.0 ? 0.0 : tick);
    tickGroups.push_back(minGroups[static_cast<int>(std::fmod(std::fabs(j), 10.0))]);
  }
  if (ticks.size() == 2) {
    ticks.insert(ticks.begin() + 1, 0.5 * (ticks[0] + ticks[1]));
    tickGroups.insert(tickGroups.begin() + 1, 5);
  }
  return true;
}

double ComputeBelowDataMinPenalty(double b, double s, double range, double belowMaxMargin) {
  const double p = (b - s) / range;
  return belowMaxMargin > 0.0 ? p / belowMaxMargin : p;
}

double ComputeAboveDataMaxPenalty(double S, double c, double range, double aboveMaxMargin) {
  const double p = (S - c) / range;
  return aboveMaxMargin > 0.0 ? p / aboveMaxMargin : p;
}

double ComputeBelowFirstTickPenalty(double f, double s, double increment, double lowTickMargin) {
  const double p = (f - s) / increment;
  return lowTickMargin > 0.0 ? p / lowTickMargin : p;
}

double ComputeAboveLastTickPenalty(double S, double t, double increment, double highTickMargin) {
  const double p = (S - t) / increment;
  return highTickMargin > 0.0 ? p / highTickMargin : p;
}

double ComputeUglyTickPenalty(double f, int group) {
  return f == 0.0 ? 0.0 : group / 7.0;
}

double ComputeUglyTickIncrementPenalty(int group) {
  return group / 7.0;
}

double ComputeNoZeroTickPenalty(double m, double M, double f, double increment, int n) {
  if (!(m <= 1e-12 && M >= -1e-12) || n < 1) return 1.0;
  // The tick nearest zero is the only one that can be within 1e-12 of it.
  const double k = std::nearbyint(-f / increment);
  if (k < 0.0 || k >= n) return 1.0;
  return std::fabs(f + k * increment) <= 1e-12 ? 0.0 : 1.0;
}

double ComputeTickCountPenalty(int n) {
  if (n > 11) return 1.0;
  return aiNiceTickCountsArray[std::max(n, 1) - 1] / 10.0;
}

double ComputeMultiplesPenalty(double f, double increment) {
  const double q = f / increment;
  return std::fabs(q - std::nearbyint(q)) <= 1e-9 ? 0.0 : 1.0;
}

double ComputeScaleMaxPenalty(double S, double d) {
  return S > d ? 1.0 : 0.0;
}

namespace {

// Range margins measured on the data range L of the normalised frame.
struct Extents {
  double L, a, b, c, d;
  explicit Extents(const TickSearch& s)
      : L(s.M - s.m),
        a(s.m - s.belowMax * L),
        b(s.m - s.belowMin * L),
        c(s.M + s.aboveMin * L),
        d(s.M + s.aboveMax * L) {}
};

// The tick counts worth trying for one (first tick, increment): those whose
// last tick can pass the limit, scale-maximum and tick-margin checks, with a
// count of slack each way (the checks themselves decide).
void countWindow(const TickSearch& s, const Extents& x, double f, double i, bool single, int* top,
                 int* bottom) {
  const double upper = single ? s.upperLimit : std::min(s.upperLimit, std::max(x.c, x.d));
  const double lower = std::min(s.upperLimit, x.c - s.highTickMargin * i);
  const double hi = (upper - f) / i + 2.0;
  const double lo = (lower - f) / i;
  // NaN or out-of-range quotients fall back to the full range of counts.
  *top = !(hi < s.maxTicks) ? s.maxTicks : static_cast<int>(std::max(hi, 0.0));
  *bottom = !(lo > s.minTicks) ? s.minTicks : static_cast<int>(std::min(lo, 1e9));
}

}  // namespace

bool FindHighestNicenessScore(const std::vector<double>& increments,
                              const std::vector<int>& incGroups,
                              const std::vector<double>& firstTicks,
                              const std::vector<int>& tickGroups, const TickSearch& s,
                              double lowestFirst, double highestFirst, TickChoice& choice) {
  const Extents x(s);
  const bool single = increments.size() == 1;
  double lowBound = lowestFirst, highBound = highestFirst;
  bool found = false;
  double best = 0.0;
  for (std::size_t ii = 0; ii < increments.size(); ++ii) {
    const double i = increments[ii];
    const double p6 = ComputeUglyTickIncrementPenalty(incGroups[ii]);
    for (std::size_t fi = 0; fi < firstTicks.size(); ++fi) {
      const double f = firstTicks[fi];
      const double sMin = std::min(x.b, f);
      // Below the lowest scale start the bounds of the candidate before
      // carry over.
      if (sMin >= x.a) {
        lowBound = std::max(sMin, s.lowerLimit);
        highBound = std::max(sMin + s.lowTickMargin * i, s.lowerLimit);
      }
      // From b on, every first tick gets the same bounds; the ticks ascend,
      // so none after one above them can pass.
      if (f >= x.b && f > highBound) break;
      if (!(f >= lowBound && f <= highBound)) continue;
      const double p1 = ComputeBelowDataMinPenalty(x.b, sMin, x.L, s.belowMax);
      const double p3 = ComputeBelowFirstTickPenalty(f, sMin, i, s.lowTickMargin);
      const double p5 = ComputeUglyTickPenalty(f, tickGroups[fi]);
      const double p9 = ComputeMultiplesPenalty(f, i);
      int top = 0, bottom = 0;
      countWindow(s, x, f, i, single, &top, &bottom);
      for (int n = top; n >= bottom; --n) {
        const double t = f + (n - 1) * i;
        const double S = std::max(x.c, t);
        if (S > x.d && !single) continue;
        if (!(t >= std::min(s.upperLimit, S - s.highTickMargin * i) &&
              t <= std::min(s.upperLimit, S)))
          continue;
        const double p2 = ComputeAboveDataMaxPenalty(S, x.c, x.L, s.aboveMax);
        const double p4 = ComputeAboveLastTickPenalty(S, t, i, s.highTickMargin);
        const double p7 = ComputeNoZeroTickPenalty(s.m, s.M, f, i, n);
        const double p8 = ComputeTickCountPenalty(n);
        const double p10 = ComputeScaleMaxPenalty(S, x.d);
        const double score = (p1 + p2 + p3 + p4) * 0.25 + (p5 + p6 + p8) * 10000.0 / 3.0 +
                             1e6 * p9 + 1e8 * p7 + 1e9 * p10;
        if (!found || score < best) {
          found = true;
          best = score;
          choice = TickChoice{sMin, S, f, t, i};
        }
      }
    }
  }
  return found;
}

namespace {

// Arguments brought into the domain the rules assume; false for data that
// are not finite numbers.
bool sanitize(TickSearch& s) {
  if (!std::isfinite(s.m) || !std::isfinite(s.M)) return false;
  if (s.m > s.M) std::swap(s.m, s.M);
  for (double* margin :
       {&s.belowMin, &s.belowMax, &s.aboveMin, &s.aboveMax, &s.lowTickMargin, &s.highTickMargin}) {
    if (!(*margin > 0.0)) *margin = 0.0;
    *margin = std::min(*margin, DBL_MAX);
  }
  if (s.belowMin > s.belowMax) std::swap(s.belowMin, s.belowMax);
  if (s.aboveMin > s.aboveMax) std::swap(s.aboveMin, s.aboveMax);
  if (std::isnan(s.lowerLimit) || isNoLimit(s.lowerLimit)) s.lowerLimit = -kInf;
  if (std::isnan(s.upperLimit) || isNoLimit(s.upperLimit)) s.upperLimit = kInf;
  if (s.lowerLimit > s.upperLimit) std::swap(s.lowerLimit, s.upperLimit);
  if (s.lowerLimit > s.M) s.lowerLimit = -kInf;
  if (s.upperLimit < s.m) s.upperLimit = kInf;
  s.minTicks = std::max(2, std::min(s.minTicks, kTickCountCap));
  s.maxTicks = std::max(s.minTicks, std::min(s.maxTicks, kTickCountCap));
  return true;
}

void mirror(TickSearch& s) {
  std::swap(s.m, s.M);
  s.m = -s.m;
  s.M = -s.M;
  std::swap(s.lowerLimit, s.upperLimit);
  s.lowerLimit = -s.lowerLimit;
  s.upperLimit = -s.upperLimit;
  std::swap(s.belowMin, s.aboveMin);
  std::swap(s.belowMax, s.aboveMax);
  std::swap(s.lowTickMargin, s.highTickMargin);
}

// Widens a range too narrow for any increment: by half a unit of its
// magnitude on each side that may move, or to -0.5 .. 0.5 about zero.
void widenDegenerate(TickSearch& s) {
  const double L = std::max(s.M - s.m, 0.0);
  const double A = std::max(s.M, -s.m);
  const double T = A * 1e-11 + 1e-14;
  if (!(L / (std::max(s.maxTicks, 11) - 1) <= T)) return;
  const double c = std::fabs(s.m) * 0.5 + std::fabs(s.M) * 0.5;
  if (c >= 1e-12) {
    const double half = scaleBy(0.5, ComputePower(c));
    if (s.belowMax > 0.0) s.m = clampToRange(s.m - half);
    if (s.aboveMax > 0.0) s.M = clampToRange(s.M + half);
  } else if (L == 0.0) {
    // Tiny data that differ keep their own range.
    s.m = -0.5;
    s.M = 0.5;
  }
}

// The search in the normalised frame, or the plain scale when no candidate
// passes.
TickChoice search(const TickSearch& s) {
  const Extents x(s);
  const double smallest = (x.c - x.b) / ((s.maxTicks - 1) + s.lowTickMargin + s.highTickMargin);
  const double largest = (x.d - x.a) / (s.minTicks - 1);
  const double lowestFirst = std::max(x.a, s.lowerLimit);
  const double highestFirst = std::max(x.b + s.lowTickMargin * largest, s.lowerLimit);
  // Candidate lists reused from call to call on each thread: a call then
  // allocates nothing once the lists have grown.
  thread_local std::vector<double> increments, firstTicks;
  thread_local std::vector<int> incGroups, tickGroups;
  TickChoice choice{};
  if (std::isfinite(smallest) && std::isfinite(largest) &&
      FindSetOfNiceNumbers(smallest, largest, adNiceIncValsArray, aiNiceIncGrpsArray, 10,
                           increments, incGroups) &&
      FindNiceFirstTicks(lowestFirst, highestFirst, aiNiceTickMinGrpsArray,
                         ComputePower(increments.front()), firstTicks, tickGroups) &&
      FindHighestNicenessScore(increments, incGroups, firstTicks, tickGroups, s, lowestFirst,
                               highestFirst, choice))
    return choice;
  return TickChoice{s.m, s.M, s.m, s.M, (s.M - s.m) / (s.minTicks - 1)};
}

// Room of at least 2% of the range between an end tick and a free scale end.
void addBreathingRoom(const TickSearch& s, double L, TickChoice& r) {
  if (s.belowMin < s.belowMax) {
    const double room = (r.firstTick - r.scaleMinimum) / L;
    if (room < 0.02) r.scaleMinimum -= (0.02 - room) * L;
  }
  if (s.aboveMin < s.aboveMax) {
    const double room = (r.scaleMaximum - r.lastTick) / L;
    if (room < 0.02) r.scaleMaximum += (0.02 - room) * L;
  }
}

// Free scale ends to about five significant digits of the scale's extent.
void roundScale(const TickSearch& s, TickChoice& r) {
  const double extent = r.scaleMaximum - r.scaleMinimum;
  if (!(extent > 0.0) || !std::isfinite(extent)) return;
  const double digits = std::max(0.0, 4.0 - std::floor(std::log10(extent)));
  const int d = static_cast<int>(std::min(digits, 300.0));
  if (s.belowMin < s.belowMax) r.scaleMinimum = roundScaleEnd(r.scaleMinimum, d, true);
  if (s.aboveMin < s.aboveMax) r.scaleMaximum = roundScaleEnd(r.scaleMaximum, d, false);
}

}  // namespace

void ComputeTicks(TickCalculationResult* result, int minTicks, int maxTicks, double belowMinMargin,
                  double belowMaxMargin, double aboveMinMargin, double aboveMaxMargin,
                  double lowerLimit, double upperLimit, double lowTickMargin, double highTickMargin,
                  double dataMin, double dataMax) {
  if (!result) return;
  *result = TickCalculationResult();
  TickSearch s{dataMin,        dataMax,        belowMinMargin, belowMaxMargin,
               aboveMinMargin, aboveMaxMargin, lowerLimit,     upperLimit,
               lowTickMargin,  highTickMargin, minTicks,       maxTicks};
  if (!sanitize(s)) return;
  const double dataLow = s.m, dataHigh = s.M;
  widenDegenerate(s);
  if (s.M == s.m) {
    // Equal data that no margin may widen: a single tick at the value.
    *result = TickCalculationResult();
    result->firstTick = result->lastTick = result->scaleMinimum = result->scaleMaximum = s.m;
    result->increment = 0.0;
    result->tickCount = 1;
    return;
  }
  const bool mirrored = std::fabs(s.M) < std::fabs(s.m);
  if (mirrored) mirror(s);
  // The end of smaller magnitude sets the decimal exponent, unless it is
  // negligible beside the other. Below 1e-30 the exponent is the data's own
  // (ComputePower would answer 0 and leave the search no nice number).
  double v = s.m;
  if (std::fabs(s.m) <= std::fabs(s.M) / 1.001e18) {
    s.m = 0.0;
    v = s.M;
  }
  const int P = std::fabs(v) >= 1e-30 ? ComputePower(v) : decimalExponent(v);
  s.m = scaleBy(s.m, -P);
  s.M = scaleBy(s.M, -P);
  // Infinite (no-limit) values stay infinite.
  s.lowerLimit = scaleBy(s.lowerLimit, -P);
  s.upperLimit = scaleBy(s.upperLimit, -P);

  TickChoice r = search(s);
  const double L = s.M - s.m;
  if (mirrored) {
    r = TickChoice{-r.scaleMaximum, -r.scaleMinimum, -r.lastTick, -r.firstTick, r.increment};
    mirror(s);
  }
  addBreathingRoom(s, L, r);
  roundScale(s, r);

  result->firstTick = clampToRange(scaleBy(r.firstTick, P));
  result->lastTick = clampToRange(scaleBy(r.lastTick, P));
  result->increment = clampToRange(scaleBy(r.increment, P));
  // Denormalising rounds: the scale is kept around the data and the ticks.
  result->scaleMinimum =
      std::min({clampToRange(scaleBy(r.scaleMinimum, P)), dataLow, result->firstTick});
  result->scaleMaximum =
      std::max({clampToRange(scaleBy(r.scaleMaximum, P)), dataHigh, result->lastTick});
  const double steps = (result->lastTick - result->firstTick) / result->increment + 0.5;
  result->tickCount = steps >= 0.0 ? static_cast<int>(std::min(steps, 1e9)) + 1 : 1;
}

}  // namespace deprecated
}  // namespace qel
