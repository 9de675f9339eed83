// Noncentral t tails at df below 0.01 (see noncentral_t.h).
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
// Rabinowitz, Methods of Numerical Integration, 2nd ed., 1984, section 6.2).
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

constexpr double kLnSqrt2Pi = 0.91893853320467274178;
constexpr double kLnTwo = 0.69314718055994530942;
// Exponents below this give exp() = 0 (and the armed state would trap on
// the subnormal result).
constexpr double kExpFloor = -708.39;
// Agreement of a panel with its halves, relative to the first estimate of
// the integral, and the depth of the halving.
constexpr double kPanelTolerance = 1e-16;
constexpr int kMaxDepth = 8;

// Positive nodes and weights of the 16-point Gauss-Legendre rule on [-1, 1].
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
  Integrand(double n, double a, double c) : shape_(0.5 * n), c_(c) {
    // ln z = ln(n/2) - 2 ln a + 2 ln v.
    lzOffset_ = std::log(shape_) - 2.0 * std::log(a);
  }

  // ln v at which z = 1.
  double turn() const { return -0.5 * lzOffset_; }

  Pair atLog(double w) const {
    const double v = w < kExpFloor ? 0.0 : std::exp(w);
    return at(v, lzOffset_ + 2.0 * w, w);
  }

  Pair atLinear(double v) const { return at(v, lzOffset_ + 2.0 * std::log(v), 0.0); }

 private:
  Pair at(double v, double lz, double logJacobian) const {
    const double u = c_ + v;
    const double e = logJacobian - 0.5 * u * u - kLnSqrt2Pi;
    Pair p;
    if (e < kExpFloor) return p;
    const double density = std::exp(e);
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

  double shape_, c_, lzOffset_;
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
// phi(c + v) < 1e-330 for c < -39): widths growing from v0/2 by half each
// step (the turn of G may sit just above v0) up to 2/(1 + max(c + v, 0))
// and at most 1, until the normal factor has fallen below 1e-21 of its
// largest value on the piece.
void linearPanels(const Integrand& f, double c, double v0, Panel* panels, int* count, int capacity,
                  Pair* sum) {
  const double start = std::max(v0, -c - 39.0);
  const double u0 = c + start;
  const double uEnd = u0 > 0.0 ? std::sqrt(u0 * u0 + 97.0) : 9.9;
  const double vEnd = uEnd - c;
  auto atLinear = [&f](double v) { return f.atLinear(v); };
  double lo = start;
  while (lo < vEnd && *count < capacity) {
    const double width = std::min({0.5 * lo, 2.0 / (1.0 + std::max(c + lo, 0.0)), 1.0});
    const double hi = std::min(lo + width, vEnd);
    const Pair v = gauss16(atLinear, lo, hi);
    panels[(*count)++] = {false, lo, hi, v};
    *sum += v;
    lo = hi;
  }
}

// int_0^inf phi(c + v) G(v/a) dv and the same with G~, for a > 0.
Pair integrals(double n, double a, double c) {
  const Integrand f(n, a, c);
  constexpr int kCapacity = 400;
  Panel panels[kCapacity];
  int count = 0;
  Pair first;
  const double v0 = 1.0 / (1.0 + std::fabs(c));
  logPanels(f, std::log(v0), panels, &count, kCapacity / 2, &first);
  linearPanels(f, c, v0, panels, &count, kCapacity, &first);
  const Pair tolerance{kPanelTolerance * first.g, kPanelTolerance * first.gc};
  auto atLog = [&f](double w) { return f.atLog(w); };
  auto atLinear = [&f](double v) { return f.atLinear(v); };
  Pair sum;
  for (int i = 0; i < count; ++i) {
    const Panel& p = panels[i];
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

}  // namespace nct
}  // namespace qel
