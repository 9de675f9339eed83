// Noncentral t tails at double precision (see noncentral_t.h).
//
// With x = t^2/(n + t^2), y = n/(n + t^2), b = n/2 and L = delta^2/2, the
// Poisson mixture of Lenth (AS 243, Applied Statistics 38, 1989) is, for
// t >= 0 and delta >= 0,
//   P(T <= t) = Phi(-delta) + (1/2) sum_j [W(j) I(j + 1/2) + W(j + 1/2) I(j + 1)],
//   P(T > t)  = (1/2) sum_j [W(j) C(j + 1/2) + W(j + 1/2) C(j + 1)],
// with I(a) = I_x(a, b), C(a) = 1 - I(a) and W(u) = e^-L L^u / Gamma(u + 1).
// Both sums have positive terms, so each tail is a sum of its own and keeps
// its relative accuracy. Following Benton & Krishnamoorthy (Computational
// Statistics & Data Analysis 43, 2003), each sum starts at the mode of the
// weights with one incomplete beta ratio (TOMS 708; again from nearer its own
// largest term when it comes out below 1e-250, where the start values may
// have underflowed) and walks outward in both directions on the recurrences
//   I(a + 1) = I(a) - g(a),  C(a + 1) = C(a) + g(a),
//   g(a) = x^a y^b / (a B(a, b)),  g(a + 1) = g(a) x (a + b)/(a + 1),
// each direction stopping on a bound of the rest it leaves out: the Poisson
// weights beyond the index times the largest the beta factor can still be.
// Going forward I falls and C rises; going backward the reverse; the ratio
// is taken in the direction where it adds and only subtracts across the
// range where the weights are already small.
//
// For t < 0 < delta, P(T <= t) = (1/2) sum_j [W(j) C(j + 1/2) - W(j + 1/2)
// C(j + 1)], a difference of nearly equal sums whenever the tail is small
// against Phi(-delta). Where it cancels, the tail comes from the integral
//   P(T <= t) = E[Phi(-delta - |t| S)],  S = sqrt(chi^2_n / n),
// in s = ln S: an integrand exp(n psi(s) - v^2/2) erfcx(v/sqrt 2) with
// psi(s) = s - (e^(2s) - 1)/2 and v = delta + |t| e^s, positive and entire in
// s. The trapezoidal rule on the whole line converges geometrically for
// such integrands (Trefethen & Weideman, SIAM Review 56, 2014), at a rate
// set by the strip |Im s| < pi/4 in which e^(2s) keeps its positive real
// part: a step of 0.4 times the width of the peak gives about 1e-17 at
// df = 10 (0.5 gives 1e-14), and narrower steps serve smaller df, whose
// peak is wider against that strip.
#include "utilities/distributions/noncentral_t.h"

#include <algorithm>
#include <cmath>

#include "utilities/distributions/saddle_density.h"
#include "utilities/elv/normal_precise.h"
#include "utilities/higher_functions/incomplete_beta.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace nct {

namespace {

// A rest below this fraction of the sum is left out.
constexpr double kRest = 1e-17;
// Longest walk of one direction of a mixture sum.
constexpr long kMaxSteps = 2000000;
// Sums below this are taken again nearer their peak and scaled by kTop.
constexpr double kTinyStart = 1e-250;
constexpr double kTop = 0x1p600;
// The mixture's difference is kept for t < 0 while it is at least this
// fraction of the two sums' mean (at most a factor 4 of cancellation).
constexpr double kKeptDifference = 0.25;
constexpr double kMixtureDeltaLimit = 1.25;
// Where the left tail of the integral starts to be squeezed, in units of
// the squeeze's own scale.
constexpr double kSqueeze = 2.0;
// Smallest df taken here: the peak of the integral widens like 1/df.
constexpr double kMinDf = kTinyDfLimit;
// Below this x the tails are those at t = 0, and the backward walk's
// division by x could overflow.
constexpr double kTinyX = 1e-290;
constexpr double kExpMinusSqueeze = 0.13533528323661269189;  // e^-kSqueeze
constexpr double kLn2 = 0.69314718055994530942;
constexpr double kInvSqrt2 = 0.70710678118654752440;
constexpr double kLnSqrtTwoOverPi = -0.22579135264472743236;  // ln sqrt(2/pi)

struct Shape {
  double x, y, b, L;
};

struct Sums {
  double lower = 0.0;  // sum of W I
  double upper = 0.0;  // sum of W C
};

// The terms at the start index of a walk: W(j + h), I and C at a = j + h +
// 1/2, and g(a).
struct Start {
  double h;
  long j;
  double a, w, I, C, g;
};

Start startAt(const Shape& s, double h, long j) {
  Start st{h, j, j + h + 0.5, saddle::poissonMass(j + h, s.L), 0.0, 0.0, 0.0};
  int ierr = 0;
  BRATIO(st.a, s.b, s.x, s.y, &st.I, &st.C, &ierr);
  st.g = brcomp(st.a, s.b, s.x, s.y) / st.a;
  return st;
}

// sum over j >= 0 of W(j + h) I(j + h + 1/2) (lower) and of W(j + h)
// C(j + h + 1/2) (upper), walking out from the start index. A walk for one
// of the sums alone may carry its beta factors times top (the recurrences
// are linear in them), so that terms of a sum near the bottom of the double
// range do not fall below the smallest normal double.
Sums mixture(const Shape& s, const Start& st, bool wantLower, bool wantUpper, double top = 1.0) {
  const double x = s.x, b = s.b, L = s.L, h = st.h;
  const long start = st.j;
  const double a0 = st.a, w0 = st.w;
  const double i0 = st.I * top, c0 = st.C * top, g0 = st.g * top;
  Sums sum;

  // Forward: j = start, start + 1, ... q is the ratio W(j + 1 + h)/W(j + h).
  double I = i0, C = c0, g = g0, w = w0, a = a0;
  double q = L / (start + h + 1.0);
  for (long j = start, step = 0; step < kMaxSteps; ++step) {
    sum.lower += w * I;
    sum.upper += w * C;
    I = std::max(I - g, 0.0);
    C = std::min(C + g, top);
    const double ratio = x * (a + b) / (a + 1.0);
    g *= ratio;
    a += 1.0;
    ++j;
    w *= q;
    if (w == 0.0) break;
    q = L / (j + h + 1.0);
    if (q >= 1.0) continue;
    // From j on the weight ratios are at most q and the ratios of the g at
    // most R (the last one while b >= 1, where they fall; x for b < 1, where
    // they rise towards it). I only falls, so the rest of its sum is at most
    // w I/(1 - q); C(j + i) <= C + g (1 + R + ... + R^(i-1)), which sums to
    // at most w (C + g q/(1 - q R))/(1 - q) while q R < 1. Compared without
    // division.
    const double R = b >= 1.0 ? ratio : x;
    const double room = kRest * (1.0 - q), qR = 1.0 - q * R;
    const bool lowerDone = !wantLower || I * w <= room * sum.lower;
    const bool upperDone =
        !wantUpper || (qR > 0.0 && (C * qR + g * q) * w <= room * qR * sum.upper);
    if (lowerDone && upperDone) break;
  }

  // Backward: j = start - 1, ..., 0.
  I = i0;
  C = c0;
  g = g0;
  w = w0;
  a = a0;
  const double inverseL = 1.0 / L;
  for (long j = start; j > 0;) {
    g *= a / (x * (a - 1.0 + b));
    a -= 1.0;
    I = std::min(I + g, top);
    C = std::max(C - g, 0.0);
    w *= (j + h) * inverseL;
    --j;
    sum.lower += w * I;
    sum.upper += w * C;
    if (j == 0 || w == 0.0) break;
    const double below = j - 1.0 + h;
    if (below >= L) continue;
    // Weights below j: at most W(j - 1 + h) L/(L - (j - 1 + h)), with
    // W(j - 1 + h) = w (j + h)/L; I rises to at most 1, C only falls.
    const double restWeight = w * (j + h), room = kRest * (L - below);
    const bool lowerDone = !wantLower || restWeight <= room * sum.lower;
    const bool upperDone = !wantUpper || C * restWeight <= room * sum.upper;
    if (lowerDone && upperDone) break;
  }
  return sum;
}

// Index near the largest term of a sum whose beta factor is in its tail,
// where I(a + 1)/I(a) and C(a + 1)/C(a) are near x (a + b)/a: the u = j +
// h + 1/2 with (u + 1/2) u = L x (u + b).
long peakIndex(const Shape& s, double h) {
  const double lx = s.L * s.x;
  const double c = lx - 0.5;
  const double u = 0.5 * (c + std::sqrt(c * c + 4.0 * lx * s.b));
  const double j = std::floor(u - h - 0.5);
  return j < 0.0 ? 0 : static_cast<long>(std::min(j, 1e15));
}

// One of the sums (lower or upper) of the weight shift of st, which starts
// at the mode of the weights; taken again from near its own peak when it
// came out so small that the start values may have underflowed.
double shiftSum(const Shape& s, const Start& st, bool lower) {
  const Sums sum = mixture(s, st, lower, !lower);
  const double value = lower ? sum.lower : sum.upper;
  if (value >= kTinyStart) return value;
  const long peak = peakIndex(s, st.h);
  const bool moved = lower ? peak < st.j : peak > st.j;
  const Sums again = mixture(s, moved ? startAt(s, st.h, peak) : st, lower, !lower, kTop);
  return (lower ? again.lower : again.upper) / kTop;
}

// Half the sum of both weight shifts: the lower or the upper mixture term.
double halfMixture(const Shape& s, const Start& whole, const Start& half, bool lower) {
  return 0.5 * (shiftSum(s, whole, lower) + shiftSum(s, half, lower));
}

// psi(s) = s - (e^(2s) - 1)/2 with w = e^s given. Near s = 0, where n psi
// is a small difference of terms of size n |s| (1e9 degrees of freedom put
// nodes at |s| ~ 1e-4, terms of 1e5), by its series
//   psi(s) = -s^2 (1 + (2s/3)(1 + (2s/4)(1 + (2s/5)(1 + ...)))),
// whose terms fall at least eightfold for |s| <= 1/8; elsewhere w - 1 is
// exact to 9 ulp.
double psi(double s, double w) {
  if (std::fabs(s) <= 0.125) {
    // 2/k for k = 3, ..., 18.
    static constexpr double kTwoOver[16] = {
        2.0 / 3,  2.0 / 4,  2.0 / 5,  2.0 / 6,  2.0 / 7,  2.0 / 8,  2.0 / 9,  2.0 / 10,
        2.0 / 11, 2.0 / 12, 2.0 / 13, 2.0 / 14, 2.0 / 15, 2.0 / 16, 2.0 / 17, 2.0 / 18};
    double inner = 1.0;
    for (int i = 15; i >= 0; --i) inner = 1.0 + s * kTwoOver[i] * inner;
    return -s * s * inner;
  }
  return s - 0.5 * (w - 1.0) * (w + 1.0);
}

// P(T <= t) for t < 0 < delta by the trapezoidal rule in s = ln S.
double oppositeSignsIntegral(double t, double n, double delta) {
  const double a = -t;
  // Peak of exp(n psi(s) - v^2/2): (n + a^2) w^2 + a delta w - n = 0.
  double w;
  if (a >= 1.0) {
    w = (2.0 * n / a) / (delta + std::sqrt(delta * delta + 4.0 * n * (n / a / a + 1.0)));
  } else {
    w = 2.0 * n / (a * delta + std::sqrt(a * a * delta * delta + 4.0 * n * (n + a * a)));
  }
  const double peak = std::log(w);
  const double v = delta + a * w;
  const double aw = a * w;
  const double sigma = 1.0 / std::sqrt(2.0 * n * w * w + aw * aw + v * aw);
  // Finer steps for small n, where the peak is wide in s and the strip in
  // which e^(2s) keeps the integrand small is narrower against it.
  const double step = sigma * (n >= 8.0 ? 0.4 : 0.4 * std::sqrt(n / 8.0));
  auto exponent = [&](double s, double* scale) {
    // e^s itself, not 1 + expm1(s): far left of 0 the sum loses e^s.
    const double w = std::exp(s);
    const double vs = delta + a * w;
    *scale = erfc1(1, vs * kInvSqrt2);
    return n * psi(s, w) - 0.5 * vs * vs;
  };
  // The nodes are s = u - lambda e^((u0 - u)/lambda) for u = peak + k step,
  // lambda = 2 sigma and u0 = peak - 2 lambda: close to the identity near
  // the peak and to its right (a shift of 0.27 sigma at the peak), and a
  // double-exponential squeeze of the slowly (e^(n s)) decaying left tail.
  // The map is entire and keeps its direction for |Im u| < pi lambda/2, ten
  // steps, so the rule keeps its geometric convergence (Takahasi & Mori's
  // variable transformation, Publ. RIMS 9, 1974).
  const double lambda = 2.0 * sigma;
  const double shift0 = lambda * kExpMinusSqueeze;
  const double stepFactor = std::exp(step / lambda);
  double scale0 = 0.0;
  double top = exponent(peak - shift0, &scale0);
  double sum = scale0 * (1.0 + shift0 / lambda);
  for (int side = -1; side <= 1; side += 2) {
    const double factor = side < 0 ? stepFactor : 1.0 / stepFactor;
    double shift = shift0;
    for (long k = 1; k < 100000; ++k) {
      shift *= factor;
      const double s = peak + side * k * step - shift;
      double scale = 0.0;
      double e = exponent(s, &scale) - top;
      const double jacobian = 1.0 + shift / lambda;
      if (e > 0.0) {
        // A node above the estimated peak: rescale what is summed so far.
        sum *= std::exp(-e);
        top += e;
        e = 0.0;
      }
      const double term = e < -745.0 ? 0.0 : std::exp(e) * scale * jacobian;
      sum += term;
      if (term <= 2e-18 * sum && (side > 0 || n * (step * k + shift) > 2.0)) break;
    }
  }
  // C/2 with C = sqrt(2m/pi) e^-stirlerr(m), m = n/2, the density constant
  // of S in s (the e^(-m) of e^(-n e^(2s)/2) is inside psi).
  const double m = 0.5 * n;
  const double logResult = kLnSqrtTwoOverPi + 0.5 * std::log(m) - saddle::stirlerr(m) - kLn2 + top +
                           std::log(sum * step);
  return logResult < -745.0 ? 0.0 : std::exp(logResult);
}

}  // namespace

bool tails(double t, double df, double delta, double* lower, double* upper) {
  if (df < kTinyDfLimit) return tinyDfTails(t, df, delta, lower, upper);
  // Beyond these the walks and the integral grow long (or, for a delta
  // whose square underflows, have no weights to walk); the ELV routine
  // answers there.
  if (!(std::fabs(delta) <= 1000.0 && std::fabs(delta) >= 1e-150) ||
      !(df >= kMinDf && df <= 1e10) || !(std::fabs(t) < 1e300)) {
    return false;
  }
  const bool reflected = delta < 0.0;
  if (reflected) {
    t = -t;
    delta = -delta;
  }
  double lo, up;
  const double magnitude = std::fabs(t);
  Shape s;
  s.b = 0.5 * df;
  s.L = 0.5 * delta * delta;
  if (magnitude >= 1.0) {
    const double q = df / magnitude / magnitude;
    s.x = 1.0 / (1.0 + q);
    s.y = q / (1.0 + q);
  } else {
    const double u = t * t;
    s.x = u / (df + u);
    s.y = df / (df + u);
  }
  if (delta == 0.0 || s.y == 0.0) return false;
  const double phiUpper =
      t >= 0.0 || s.x == 0.0 ? elv::normalUpperTail(delta) : 0.0;  // Phi(-delta)
  if (s.x < kTinyX) {
    // t = 0, or t so small (|t| < 1e-145 sqrt(df)) that the tails are
    // those at 0 to double precision.
    lo = phiUpper;
    up = 1.0 - phiUpper;
  } else if (t > 0.0) {
    // The smaller tail is summed; the larger one, at least 1/2, is its
    // complement unless the guess of the smaller was wrong. The median is
    // near delta.
    const long mode = static_cast<long>(std::floor(s.L));
    const Start whole = startAt(s, 0.0, mode), half = startAt(s, 0.5, mode);
    if (t < delta) {
      lo = phiUpper + halfMixture(s, whole, half, true);
      up = lo <= 0.5 ? 1.0 - lo : halfMixture(s, whole, half, false);
    } else {
      up = halfMixture(s, whole, half, false);
      lo = up <= 0.5 ? 1.0 - up : phiUpper + halfMixture(s, whole, half, true);
    }
  } else {
    // At t = 0- the difference is 2 Phi(-delta) against a mean of
    // Phi(delta): from delta = 1.25 on it cancels beyond the kept limit
    // already there, and the integral answers at once.
    lo = -1.0;
    if (delta < kMixtureDeltaLimit) {
      const long mode = static_cast<long>(std::floor(s.L));
      const double a = shiftSum(s, startAt(s, 0.0, mode), false);
      const double c = shiftSum(s, startAt(s, 0.5, mode), false);
      if (a - c >= kKeptDifference * 0.5 * (a + c)) lo = 0.5 * (a - c);
    }
    if (lo < 0.0) lo = oppositeSignsIntegral(t, df, delta);
    up = 1.0 - lo;
  }
  if (reflected) std::swap(lo, up);
  *lower = std::min(std::max(lo, 0.0), 1.0);
  *upper = std::min(std::max(up, 0.0), 1.0);
  return true;
}

}  // namespace nct
}  // namespace qel
