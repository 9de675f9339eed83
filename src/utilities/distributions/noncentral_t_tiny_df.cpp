// Noncentral t tails and density at df below 0.01 (see noncentral_t.h).
//
// T = (Z + delta)/S with S = sqrt(V/n), V chi-square with n df. At tiny n
// almost all the mass of S lies near 0 (P(S <= s) = P(n/2, n s^2/2), about
// (n s^2/2)^(n/2)), so T is nearly +-infinity with the sign of Z + delta and
// the tails tend to Phi(-delta) and Phi(delta); the Poisson mixture of AS 243
// then sums beta ratios at a vanishing shape against a weight of order n,
// and the integral over the density of ln S spreads over 1/n units. Instead
// the expectation over S is integrated by parts against the normal law,
// with G(s) = P(S <= s) and G~ = 1 - G: for t = a > 0 and delta >= 0,
//   P(T <= t) = Phi(-delta) + int_0^inf phi(v - delta) G~(v/a) dv,
//   P(T > t)  = int_0^inf phi(v - delta) G(v/a) dv,
// and for t = -a < 0,
//   P(T <= t) = int_0^inf phi(v + delta) G(v/a) dv,
//   P(T > t)  = Phi(delta) + int_0^inf phi(v + delta) G~(v/a) dv.
// Every term is positive, so each tail keeps its relative accuracy; G and
// G~ are the regularised incomplete gamma ratios at shape n/2, whose tiny-
// shape forms keep both to full precision (small_shape_tails.h, else
// TOMS 654 via gamma_ratio.h).
//
// The integrands carry a logarithmic singularity at v = 0 (G~ ~ (n/2)
// ln(1/z) for z = n v^2/(2 a^2) -> 0) and the turn of G at z = 1, at any
// scale; both are smooth in w = ln v, where they are taken near 0 (up to
// v = 1/(1 + delta)), and the normal factor in v itself beyond. Each piece
// is cut into panels of the 16-point Gauss-Legendre rule, each panel halved
// until its two halves agree with it (adaptive bisection; Davis &
// Rabinowitz, Methods of Numerical Integration, 2nd ed., 1984, chapter 6).
#include <algorithm>
#include <cfloat>
#include <cmath>

#include "utilities/distributions/gamma_ratio.h"
#include "utilities/distributions/noncentral_t.h"
#include "utilities/distributions/small_shape_tails.h"
#include "utilities/elv/normal_precise.h"

namespace qel {
namespace nct {

namespace {

constexpr double kInvSqrt2Pi = 0.39894228040143267794;
constexpr double kLnTwo = 0.69314718055994530942;
// Exponents below this give exp() = 0 (and the armed state would trap on
// the subnormal result).
constexpr double kExpFloor = -708.39;
// Agreement of a panel with its halves, relative to the first estimate of
// the integral, and the depth of the halving. The difference bounds the
// error of the whole panel's rule; the halves', returned, is smaller by
// orders of magnitude (the rule converges geometrically in the panel width
// for these analytic integrands), so 1e-13 leaves them near rounding.
constexpr double kPanelTolerance = 1e-13;
constexpr int kMaxDepth = 8;

// Positive nodes and weights of the 16-point Gauss-Legendre rule on [-1, 1]
// (Abramowitz & Stegun 25.4.30).
constexpr double kNode[8] = {0.98940093499164993, 0.94457502307323258, 0.86563120238783174,
                             0.75540440835500303, 0.61787624440264375, 0.45801677765722739,
                             0.28160355077925891, 0.09501250983763744};
constexpr double kWeight[8] = {0.027152459411754095, 0.062253523938647893, 0.095158511682492785,
                               0.12462897125553387,  0.14959598881657673,  0.16915651939500254,
                               0.18260341504492359,  0.1894506104550685};

struct Pair {
  double g = 0.0;   // with G
  double gc = 0.0;  // with 1 - G
  Pair& operator+=(const Pair& o) {
    g += o.g;
    gc += o.gc;
    return *this;
  }
};

// The integrands phi(c + v) G(v/a) and phi(c + v) G~(v/a) at v = e^w (in
// the logarithmic piece, times the Jacobian v) or at v (the linear piece).
class Integrand {
 public:
  // With density set, the first integrand is phi(c + v) v^n e^-z instead
  // (the second 0): the density of T up to a factor.
  Integrand(double n, double a, double c, bool density = false)
      : shape_(0.5 * n), c_(c), density_(density) {
    // ln z = ln(n/2) - 2 ln a + 2 ln v.
    lzOffset_ = std::log(shape_) - 2.0 * std::log(a);
    // phi(c) with c^2 split exactly into hi + lo (fma), so that no rounding
    // of c^2/2 (up to 700) enters the exponent.
    const double hi = c * c, lo = std::fma(c, c, -hi);
    phiC_ = 0.5 * hi > -kExpFloor ? 0.0 : std::exp(-0.5 * hi) * (1.0 - 0.5 * lo) * kInvSqrt2Pi;
  }

  // ln v at which z = 1.
  double turn() const { return -0.5 * lzOffset_; }

  Pair atLog(double w) const {
    if (w < kExpFloor) return Pair{};
    const double v = std::exp(w);
    return at(v, lzOffset_ + 2.0 * w, v * shifted(v));
  }

  // The linear piece runs over r = v for c >= 0 and over r = c + v for
  // c < 0: the variable that is small where phi(c + v) counts, so that its
  // nodes, not a rounded sum with c, carry the normal factor (the rounding
  // of c + v moves phi by |c + v| ulp(c), 2e-14 at c = 10, and more for
  // larger c).
  Pair atLinear(double r) const {
    if (c_ >= 0.0) return at(r, lzOffset_ + 2.0 * std::log(r), shifted(r));
    const double e = -0.5 * r * r;
    if (e < kExpFloor) return Pair{};
    const double v = r - c_;
    return at(v, lzOffset_ + 2.0 * std::log(v), kInvSqrt2Pi * std::exp(e));
  }

 private:
  // phi(c + v) as phi(c) e^(-v (c + v/2)), for v small beside 1/|c| or
  // c >= 0.
  double shifted(double v) const {
    const double e = -v * (c_ + 0.5 * v);
    return e < kExpFloor ? 0.0 : phiC_ * std::exp(e);
  }

  // density times G(v/a) and G~(v/a), z = e^lz.
  Pair at(double v, double lz, double density) const {
    Pair p;
    if (!(density > 0.0) || !(v > 0.0)) return p;
    if (density_) {
      // v^n e^-z = e^(n ln v - z), with 2 ln v = lz - lzOffset.
      const double e = shape_ * (lz - lzOffset_) - (lz > 709.0 ? HUGE_VAL : std::exp(lz));
      p.g = e < kExpFloor ? 0.0 : density * std::exp(e);
      return p;
    }
    double lower = 0.0, upper = 0.0;
    chiTails(lz, &lower, &upper);
    p.g = density * lower;
    p.gc = density * upper;
    return p;
  }

  // P(n/2, z) and Q(n/2, z) for z = e^lz.
  void chiTails(double lz, double* lower, double* upper) const {
    if (lz > 709.0) {
      *lower = 1.0;
      *upper = 0.0;
      return;
    }
    const double z = lz < kExpFloor ? 0.0 : std::exp(lz);
    if ((shape_ <= smallshape::kTinyShape || z < smallshape::kTinyArgument) &&
        smallshape::gammaTails(shape_, z, lz, lower, upper)) {
      return;
    }
    if (gammaratio::tails(shape_, z, lower, upper)) return;
    // Only the upper tail can lie below the ratios' floor at these shapes.
    *lower = 1.0;
    *upper = 0.0;
  }

  double shape_, c_, lzOffset_, phiC_;
  bool density_;
};

template <class F>
Pair gauss16(const F& f, double lo, double hi) {
  const double centre = 0.5 * (lo + hi), half = 0.5 * (hi - lo);
  Pair sum;
  for (int i = 0; i < 8; ++i) {
    const Pair a = f(centre + half * kNode[i]), b = f(centre - half * kNode[i]);
    sum.g += kWeight[i] * (a.g + b.g);
    sum.gc += kWeight[i] * (a.gc + b.gc);
  }
  sum.g *= half;
  sum.gc *= half;
  return sum;
}

template <class F>
Pair refine(const F& f, double lo, double hi, const Pair& whole, const Pair& tolerance, int depth) {
  const double mid = 0.5 * (lo + hi);
  const Pair left = gauss16(f, lo, mid), right = gauss16(f, mid, hi);
  Pair both = left;
  both += right;
  if (depth == 0 || (std::fabs(both.g - whole.g) <= tolerance.g &&
                     std::fabs(both.gc - whole.gc) <= tolerance.gc)) {
    return both;
  }
  Pair sum = refine(f, lo, mid, left, tolerance, depth - 1);
  sum += refine(f, mid, hi, right, tolerance, depth - 1);
  return sum;
}

struct Panel {
  bool logarithmic;
  double lo, hi;
  Pair value;
};

// Panels of the logarithmic piece, w <= top = ln(1/(1 + |c|)): width 1
// within 5 of the turn of G or of top, width 4 beyond (where the integrand
// is e^w times a slowly varying factor), leftwards until a panel adds less
// than 1e-19 of the sum left of the turn, or 45 below top. (Mass of G~
// left of a turn that far below top is below e^-40 of the Phi(-+delta)
// that the tail adds it to.)
void logPanels(const Integrand& f, double top, Panel* panels, int* count, int capacity, Pair* sum) {
  const double turn = f.turn();
  double hi = top;
  auto atLog = [&f](double w) { return f.atLog(w); };
  while (*count < capacity) {
    const bool near = std::fabs(hi - turn) < 5.0 || top - hi < 5.0;
    const double lo = hi - (near ? 1.0 : 4.0);
    const Pair v = gauss16(atLog, lo, hi);
    panels[(*count)++] = {true, lo, hi, v};
    *sum += v;
    hi = lo;
    if (hi < top - 45.0) break;
    if (hi < std::min(turn, top) - 5.0 && v.g <= 1e-19 * sum->g && v.gc <= 1e-19 * sum->gc) break;
  }
}

// Panels of the linear piece, v from v0 = 1/(1 + |c|) (or from where
// phi(c + v) < 1e-330 for c < -39), in the variable r of
// Integrand::atLinear: widths growing from v0/2 by half each step (the turn
// of G may sit just above v0) up to 2/(1 + max(c + v, 0)) and at most 1,
// until the normal factor has fallen below 1e-21 of its largest value on
// the piece.
void linearPanels(const Integrand& f, double c, double v0, Panel* panels, int* count, int capacity,
                  Pair* sum) {
  const double start = std::max(v0, -c - 39.0);
  const double u0 = c + start;
  const double uEnd = u0 > 0.0 ? std::sqrt(u0 * u0 + 97.0) : 9.9;
  const double shift = c >= 0.0 ? 0.0 : c;  // r = v - shift
  const double rEnd = c >= 0.0 ? uEnd - c : uEnd;
  auto atLinear = [&f](double r) { return f.atLinear(r); };
  double lo = c >= 0.0 ? start : u0;
  while (lo < rEnd && *count < capacity) {
    const double v = lo - shift, u = c + v;
    const double width = std::min({0.5 * v, 2.0 / (1.0 + std::max(u, 0.0)), 1.0});
    const double hi = std::min(lo + width, rEnd);
    const Pair value = gauss16(atLinear, lo, hi);
    panels[(*count)++] = {false, lo, hi, value};
    *sum += value;
    lo = hi;
  }
}

// int_0^inf phi(c + v) G(v/a) dv and the same with G~, for a > 0.
Pair integrals(double n, double a, double c, bool density = false) {
  const Integrand f(n, a, c, density);
  constexpr int kCapacity = 400;
  Panel panels[kCapacity];
  int count = 0;
  Pair first;
  const double v0 = 1.0 / (1.0 + std::fabs(c));
  // The density's integrand vanishes (e^-z, z > e^8) beyond the turn + 4,
  // and its mass may lie anywhere below.
  const double top = density ? std::min(std::log(v0), f.turn() + 4.0) : std::log(v0);
  logPanels(f, top, panels, &count, kCapacity / 2, &first);
  linearPanels(f, c, v0, panels, &count, kCapacity, &first);
  const Pair tolerance{kPanelTolerance * first.g, kPanelTolerance * first.gc};
  auto atLog = [&f](double w) { return f.atLog(w); };
  auto atLinear = [&f](double v) { return f.atLinear(v); };
  Pair sum;
  for (int i = 0; i < count; ++i) {
    const Panel& p = panels[i];
    if (std::fabs(p.value.g) <= tolerance.g && std::fabs(p.value.gc) <= tolerance.gc) {
      sum += p.value;  // too small for its error to count
      continue;
    }
    sum += p.logarithmic ? refine(atLog, p.lo, p.hi, p.value, tolerance, kMaxDepth)
                         : refine(atLinear, p.lo, p.hi, p.value, tolerance, kMaxDepth);
  }
  return sum;
}

}  // namespace

bool tinyDfTails(double t, double df, double delta, double* lower, double* upper) {
  if (!(df > 0.0 && df < kTinyDfLimit) || !std::isfinite(t) || !std::isfinite(delta)) return false;
  const bool reflected = delta < 0.0;
  if (reflected) {
    t = -t;
    delta = -delta;
  }
  const double below = elv::normalUpperTail(delta);  // Phi(-delta)
  double lo, up;
  if (t == 0.0 || df < 4.0 * DBL_MIN) {
    // At t = 0, and where n/2 leaves the normal range (the tails move from
    // the limits by less than n times a few hundred): the n -> 0 limits.
    lo = below;
    up = 1.0 - below;
  } else if (t > 0.0) {
    const Pair i = integrals(df, t, -delta);
    lo = below + i.gc;
    up = i.g;
  } else {
    const Pair i = integrals(df, -t, delta);
    lo = i.g;
    up = (1.0 - below) + i.gc;
  }
  if (reflected) std::swap(lo, up);
  *lower = std::min(std::max(lo, 0.0), 1.0);
  *upper = std::min(std::max(up, 0.0), 1.0);
  return true;
}

// f(t) = E[S phi(t S - delta)] over the density C s^(n-1) e^(-n s^2/2) of
// S, C = 2 (n/2)^(n/2)/Gamma(n/2); with v = |t| s,
//   f(t) = C |t|^-(1+n) int_0^inf phi(v -+ delta) v^n e^(-n v^2/(2 t^2)) dv,
// a positive integrand on the panels of the tails.
double tinyDfDensity(double t, double df, double delta) {
  if (!(df >= 4.0 * DBL_MIN && df < kTinyDfLimit) || !std::isfinite(t) || t == 0.0 ||
      !std::isfinite(delta)) {
    return std::nan("");
  }
  const double a = std::fabs(t), c = t > 0.0 ? -delta : delta;
  const double integral = integrals(df, a, c, true).g;
  if (!(integral > 0.0)) return 0.0;
  const double m = 0.5 * df;
  const double logC = kLnTwo + m * std::log(m) - std::lgamma(m);
  const double e = logC - (1.0 + df) * std::log(a) + std::log(integral);
  return e < kExpFloor ? 0.0 : e > 709.0 ? HUGE_VAL : std::exp(e);
}

}  // namespace nct
}  // namespace qel
