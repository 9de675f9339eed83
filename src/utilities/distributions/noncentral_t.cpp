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
// Statistics & Data Analysis 43, 2003), each sum starts near its largest
// term with one incomplete beta ratio (TOMS 708) and walks outward in both
// directions on the recurrences
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
// such integrands (Trefethen & Weideman, SIAM Review 56, 2014); the step is
// a fraction of the width of the peak.
#include "utilities/distributions/noncentral_t.h"

#include <algorithm>
#include <cmath>

#include "utilities/distributions/saddle_density.h"
#include "utilities/elv/normal_precise.h"
#include "utilities/special_functions/incomplete_beta.h"
#include "utilities/special_functions/transcendental.h"

namespace qel {
namespace nct {

namespace {

// A rest below this fraction of the sum is left out.
constexpr double kRest = 1e-18;
// Longest walk of one direction of a mixture sum.
constexpr long kMaxSteps = 2000000;
// Start values below this are taken again nearer the peak of their sum.
constexpr double kTinyStart = 1e-250;
// The mixture's difference is kept for t < 0 while it is at least this
// fraction of the two sums' mean (at most a factor 4 of cancellation).
constexpr double kKeptDifference = 0.25;
constexpr double kInvSqrt2 = 0.70710678118654752440;
constexpr double kLnSqrtTwoOverPi = -0.22579135264472743236;  // ln sqrt(2/pi)

struct Shape {
  double x, y, b, L;
};

struct Sums {
  double lower = 0.0;  // sum of W I
  double upper = 0.0;  // sum of W C
};

// sum over j >= 0 of W(j + h) I(j + h + 1/2) (lower) and of W(j + h)
// C(j + h + 1/2) (upper), walking out from index start.
Sums mixture(const Shape& s, double h, long start, bool wantLower, bool wantUpper) {
  const double x = s.x, b = s.b, L = s.L;
  const double a0 = start + h + 0.5;
  double i0 = 0.0, c0 = 0.0;
  int ierr = 0;
  BRATIO(a0, b, x, s.y, &i0, &c0, &ierr);
  const double w0 = saddle::poissonMass(start + h, L);
  const double g0 = brcomp(a0, b, x, s.y) / a0;
  Sums sum;

  // Forward: j = start, start + 1, ...
  double I = i0, C = c0, g = g0, w = w0, a = a0;
  for (long j = start, step = 0; step < kMaxSteps; ++step) {
    sum.lower += w * I;
    sum.upper += w * C;
    I = std::max(I - g, 0.0);
    C = std::min(C + g, 1.0);
    const double ratio = x * (a + b) / (a + 1.0);
    g *= ratio;
    a += 1.0;
    ++j;
    w *= L / (j + h);
    if (w == 0.0) break;
    const double next = j + h + 1.0;
    if (next <= L) continue;
    // Weights from j on: at most w/(1 - L/next), a geometric bound.
    const double rest = w / (1.0 - L / next);
    // I only falls; C rises by at most g/(1 - ratio) when the ratio of the
    // g falls (b > 1) or stays below x (b <= 1).
    const double gRatio = b > 1.0 ? ratio : x;
    const double cBound = gRatio < 1.0 ? std::min(1.0, C + g / (1.0 - gRatio)) : 1.0;
    const bool lowerDone = !wantLower || I * rest <= kRest * sum.lower;
    const bool upperDone = !wantUpper || cBound * rest <= kRest * sum.upper;
    if (lowerDone && upperDone) break;
  }

  // Backward: j = start - 1, ..., 0.
  I = i0;
  C = c0;
  g = g0;
  w = w0;
  a = a0;
  for (long j = start; j > 0;) {
    g *= a / (x * (a - 1.0 + b));
    a -= 1.0;
    I = std::min(I + g, 1.0);
    C = std::max(C - g, 0.0);
    w *= (j + h) / L;
    --j;
    sum.lower += w * I;
    sum.upper += w * C;
    if (j == 0 || w == 0.0) break;
    const double below = j - 1.0 + h;
    if (below >= L) continue;
    // Weights below j: at most W(j - 1 + h)/(1 - (j - 1 + h)/L).
    const double rest = w * (j + h) / L / (1.0 - below / L);
    const bool lowerDone = !wantLower || rest <= kRest * sum.lower;
    const bool upperDone = !wantUpper || C * rest <= kRest * sum.upper;
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

// The sums of one weight shift h, with a second start where the first one's
// beta factor underflows.
Sums shiftSums(const Shape& s, double h, bool wantLower, bool wantUpper) {
  const long mode = static_cast<long>(std::floor(s.L));
  Sums sum = mixture(s, h, mode, wantLower, wantUpper);
  const long peak = peakIndex(s, h);
  if (wantLower && sum.lower < kTinyStart && peak < mode) {
    sum.lower = mixture(s, h, peak, true, false).lower;
  }
  if (wantUpper && sum.upper < kTinyStart && peak > mode) {
    sum.upper = mixture(s, h, peak, false, true).upper;
  }
  return sum;
}

// psi(s) = s - (e^(2s) - 1)/2 with e^s - 1 given: formed from expm1 so that
// n psi keeps an absolute error near n eps |s| at the peak.
double psi(double s, double em1) {
  return s - em1 * (1.0 + 0.5 * em1);
}

// P(T <= t) for t < 0 < delta by the trapezoidal rule in s = ln S.
double oppositeSignsIntegral(double t, double n, double delta) {
  const double a = -t;
  // Peak of exp(n psi(s) - v^2/2): (n + a^2) w^2 + a delta w - n = 0.
  double w;
  if (a >= 1.0) {
    w = (2.0 * n / a) / (delta + std::sqrt(delta * delta + 4.0 * n * (n / (a * a) + 1.0)));
  } else {
    w = 2.0 * n / (a * delta + std::sqrt(a * a * delta * delta + 4.0 * n * (n + a * a)));
  }
  const double peak = std::log(w);
  const double v = delta + a * w;
  const double sigma = 1.0 / std::sqrt(2.0 * n * w * w + a * a * w * w + v * a * w);
  // Finer steps for small n, where the peak is wide in s and the strip in
  // which e^(2s) keeps the integrand small is narrower against it.
  const double step = sigma * (n >= 8.0 ? 0.5 : 0.5 * std::sqrt(n / 8.0));
  auto exponent = [&](double s, double* scale) {
    const double em1 = std::expm1(s);
    const double vs = delta + a * (1.0 + em1);
    *scale = erfc1(1, vs * kInvSqrt2);
    return n * psi(s, em1) - 0.5 * vs * vs;
  };
  double scale0 = 0.0;
  const double top = exponent(peak, &scale0);
  double sum = scale0;
  for (int side = -1; side <= 1; side += 2) {
    for (long k = 1; k < 100000; ++k) {
      const double s = peak + side * k * step;
      double scale = 0.0;
      const double e = exponent(s, &scale) - top;
      const double term = e < -745.0 ? 0.0 : std::exp(e) * scale;
      sum += term;
      if (term <= 1e-19 * sum && (side > 0 || n * step * k > 2.0)) break;
    }
  }
  // C/2 with C = sqrt(2m/pi) e^-stirlerr(m), m = n/2, the density constant
  // of S in s (the e^(-m) of e^(-n e^(2s)/2) is inside psi).
  const double m = 0.5 * n;
  const double logResult = kLnSqrtTwoOverPi + 0.5 * std::log(m) - saddle::stirlerr(m) -
                           std::log(2.0) + top + std::log(sum * step);
  return logResult < -745.0 ? 0.0 : std::exp(logResult);
}

}  // namespace

bool tails(double t, double df, double delta, double* lower, double* upper) {
  // Beyond these the walks grow long; the ELV routine answers there.
  if (!(std::fabs(delta) <= 1000.0) || !(df > 0.0 && df <= 1e10) || !(std::fabs(t) < 1e300)) {
    return false;
  }
  const bool reflected = delta < 0.0;
  if (reflected) {
    t = -t;
    delta = -delta;
  }
  double lo, up;
  const double phiUpper = elv::normalUpperTail(delta);  // Phi(-delta)
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
  if (s.x == 0.0) {
    // t = 0, or t so small that t^2 underflows: the tails at 0.
    lo = phiUpper;
    up = 1.0 - phiUpper;
  } else if (t > 0.0) {
    const Sums a = shiftSums(s, 0.0, true, true);
    const Sums c = shiftSums(s, 0.5, true, true);
    lo = phiUpper + 0.5 * (a.lower + c.lower);
    up = 0.5 * (a.upper + c.upper);
  } else {
    const Sums a = shiftSums(s, 0.0, false, true);
    const Sums c = shiftSums(s, 0.5, false, true);
    const double difference = a.upper - c.upper;
    lo = difference >= kKeptDifference * 0.5 * (a.upper + c.upper)
             ? 0.5 * difference
             : oppositeSignsIntegral(t, df, delta);
    up = 1.0 - lo;
  }
  if (reflected) std::swap(lo, up);
  *lower = std::min(std::max(lo, 0.0), 1.0);
  *upper = std::min(std::max(up, 0.0), 1.0);
  return true;
}

}  // namespace nct
}  // namespace qel
