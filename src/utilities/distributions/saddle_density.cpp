// Saddle-point densities and masses after Loader (2000); see
// saddle_density.h.
#include "utilities/distributions/saddle_density.h"

#include <cfloat>
#include <cmath>
#include <initializer_list>
#include <stdexcept>

namespace qel {
namespace saddle {

namespace {

constexpr double kLnSqrt2Pi = 0.918938533204672741780329736406;
constexpr double k2Pi = 6.283185307179586476925286766559;

// stirlerr at 0, 0.5, 1, ..., 15 (tools/reference/gen_stirling_table.py).
const double kStirlingTable[31] = {
    0.0,
    1.5342640972002735e-1,
    8.1061466795327258e-2,
    5.4814121051917654e-2,
    4.1340695955409294e-2,
    3.3162873519936287e-2,
    2.7677925684998339e-2,
    2.3746163656297496e-2,
    2.0790672103765093e-2,
    1.8488450532673185e-2,
    1.6644691189821192e-2,
    1.5134973221917379e-2,
    1.3876128823070748e-2,
    1.2810465242920227e-2,
    1.189670994589177e-2,
    1.1104559758206917e-2,
    1.0411265261972096e-2,
    9.7994161261588033e-3,
    9.2554621827127329e-3,
    8.7687001341393855e-3,
    8.3305634333628713e-3,
    7.9341145643140205e-3,
    7.5736754879518408e-3,
    7.2445543013203832e-3,
    6.9428401072095299e-3,
    6.6652470327076824e-3,
    6.4089941880042071e-3,
    6.1717122630394576e-3,
    5.9513701127588477e-3,
    5.7462165130101157e-3,
    5.5547335519628014e-3,
};

// glibc's libm is declared noexcept: a trap raised inside log or exp in an
// armed thread cannot unwind and ends the process. These refuse the
// arguments that would trap with an exception the kernels catch instead.
double checkedLog(double v) {
  if (!(v > 0.0)) throw std::invalid_argument("logarithm of a value that is not positive");
  return std::log(v);
}

constexpr double kLargestExpArgument = 709.78;

double checkedExp(double y) {
  if (std::isnan(y)) throw std::invalid_argument("exponential of NaN");
  if (y > kLargestExpArgument) throw std::overflow_error("exponential beyond the double range");
  return std::exp(y);
}

// ln(x/m) for positive x and m, without forming a ratio beyond the double
// range (ln x - ln m there, where no digits are lost to cancellation).
double logRatio(double x, double m) {
  const double lx = checkedLog(x), lm = checkedLog(m);
  return std::fabs(lx - lm) < 700.0 ? std::log(x / m) : lx - lm;
}

}  // namespace

double stirlerr(double n) {
  if (n <= 15.0) {
    const double twice = n + n;
    if (twice == std::floor(twice)) return kStirlingTable[static_cast<int>(twice)];
    // Off the table: ln Gamma of at most ln Gamma(16) = 27.9 costs a few
    // units of 1e-15 absolute, a relative error of the density of the same.
    return std::lgamma(n + 1.0) - (n + 0.5) * checkedLog(n) + n - kLnSqrt2Pi;
  }
  // Stirling's series: 1/12, 1/360, 1/1260, 1/1680, 1/1188 over odd powers.
  const double s0 = 1.0 / 12, s1 = 1.0 / 360, s2 = 1.0 / 1260, s3 = 1.0 / 1680, s4 = 1.0 / 1188;
  // Beyond 1e10 the next term is below 1e-21 of the first (and n * n
  // would overflow from 1e154 on).
  if (n > 1e10) return s0 / n;
  const double nn = n * n;
  if (n > 500.0) return (s0 - s1 / nn) / n;
  if (n > 80.0) return (s0 - (s1 - s2 / nn) / nn) / n;
  if (n > 35.0) return (s0 - (s1 - (s2 - s3 / nn) / nn) / nn) / n;
  return (s0 - (s1 - (s2 - (s3 - s4 / nn) / nn) / nn) / nn) / n;
}

double bd0(double x, double m) {
  // The series has terms of one sign; Loader takes it for |v| < 0.1, taken
  // here up to |v| < 0.5 (some 25 terms), where the closed form would lose
  // up to a digit and a half to cancellation.
  // x + m is formed from the halves: at x = m = DBL_MAX it would overflow.
  const double halfSum = 0.5 * x + 0.5 * m;
  if (std::fabs(x - m) < halfSum) {
    // With v = (x - m)/(x + m) the deviance is (x - m) v + 2 x sum v^(2j+1)/(2j+1).
    double v = (0.5 * x - 0.5 * m) / halfSum;
    double s = (x - m) * v;
    double term = x * (2.0 * v);
    v *= v;
    for (int j = 1; j < 1000; ++j) {
      term *= v;
      const double next = s + term / (2 * j + 1);
      if (next == s) return next;
      s = next;
    }
    return s;
  }
  if (x == 0.0) return m;
  const double lr = logRatio(x, m);
  // A deviance beyond the double range: the mass is 0 to double precision.
  if (lr > 0.0 && x > DBL_MAX / (lr + 1.0)) return HUGE_VAL;
  return x * lr + m - x;
}

double poissonMass(double x, double m) {
  if (m == 0.0) return x == 0.0 ? 1.0 : 0.0;
  if (x < 0.0) return 0.0;
  if (x == 0.0) return checkedExp(-m);
  // sqrt(2 pi) sqrt(x): 2 pi x overflows near DBL_MAX.
  return checkedExp(-stirlerr(x) - bd0(x, m)) / (2.5066282746310005024 * std::sqrt(x));
}

double binomialMass(double x, double n, double p, double q) {
  if (p == 0.0) return x == 0.0 ? 1.0 : 0.0;
  if (q == 0.0) return x == n ? 1.0 : 0.0;
  if (x < 0.0 || x > n) return 0.0;
  if (x == 0.0) {
    if (n == 0.0) return 1.0;
    return checkedExp(p < 0.1 ? -bd0(n, n * q) - n * p : n * checkedLog(q));
  }
  if (x == n) return checkedExp(q < 0.1 ? -bd0(n, n * p) - n * q : n * checkedLog(p));
  const double lc = stirlerr(n) - stirlerr(x) - stirlerr(n - x) - bd0(x, n * p) - bd0(n - x, n * q);
  return checkedExp(lc) * std::sqrt(n / (k2Pi * x * (n - x)));
}

// --- Continuous densities at any shape ---------------------------------------
//
// The densities below keep Loader's split of a density into exp(core) times
// a factor, core = -stirlerr - deviance formed without cancellation, but
// carry every quantity that can leave the double range (a mean n p below
// DBL_MIN, a ratio m x / n beyond DBL_MAX, a factor 1 / (x (1 - x)) at
// x = 1e-300) by its logarithm. Shapes, degrees of freedom and scales from
// 1e-300 to 1e300 thus give the density to about 1e-13 relative, or 0 where
// it lies below the double range; a density above DBL_MAX has no double and
// is refused (overflow_error).

namespace {

constexpr double kDirectLow = 1e-100, kDirectHigh = 1e100;

// Inputs inside [1e-100, 1e100] let a product of up to three of them be
// formed directly, with the few-ulp accuracy of plain arithmetic.
bool direct(std::initializer_list<double> values) {
  for (double v : values)
    if (!(v >= kDirectLow && v <= kDirectHigh)) return false;
  return true;
}

// exp(core) times a factor f = exp(lf); f is 0 where it was not formed.
double scaledExp(double core, double f, double lf) {
  if (f > 0.0 && core > -700.0 && core < 700.0 && std::fabs(core + lf) < 700.0)
    return std::exp(core) * f;
  return checkedExp(core + lf);
}

// The deviance x ln(x/m) + m - x where the mean m may lie below DBL_MIN
// (then given by lm = ln m; m itself is negligible beside x >= DBL_MIN) or
// beyond DBL_MAX (a deviance beyond the double range).
double deviance(double x, double m, double lm) {
  if (!(m <= DBL_MAX)) return HUGE_VAL;
  if (m >= DBL_MIN) return bd0(x, m);
  if (x == 0.0) return 0.0;
  return x * (checkedLog(x) - lm) - x;
}

// The mean n p; from its logarithm lm where p lies below DBL_MIN (n p may
// still be a normal number, 5e-11 at n = 5e299, p = 1e-310).
double mean(double n, double p, double lm) {
  if (p >= DBL_MIN) return n * p;
  return lm < -708.0 ? 0.0 : std::exp(lm);
}

// A point of (0, 1) with its complement and both logarithms, each formed
// where it does not underflow.
struct UnitPoint {
  double p, q, lp, lq;
};

// ln of Gamma(x+y+1)/(Gamma(x+1) Gamma(y+1)) p^x q^y as core + lf, with the
// direct factor in *f (0 when not formed); x, y >= 0 given apart so that
// neither is lost in the rounding of x + y.
constexpr double kLargeDirect = 1e300;

double binomialCore(double x, double y, const UnitPoint& u, double* f, double* lf) {
  *f = 1.0;
  *lf = 0.0;
  if (x == 0.0) return y * u.lq;
  if (y == 0.0) return x * u.lp;
  const double n = x + y, ln = checkedLog(n);
  const double core = stirlerr(n) - stirlerr(x) - stirlerr(y) -
                      deviance(x, mean(n, u.p, ln + u.lp), ln + u.lp) -
                      deviance(y, mean(n, u.q, ln + u.lq), ln + u.lq);
  const double lx = checkedLog(x), ly = checkedLog(y);
  *lf = 0.5 * (ln - lx - ly) - kLnSqrt2Pi;
  *f = direct({x, y, n}) ? std::sqrt(n / (k2Pi * x * y)) : 0.0;
  // Large counts: the same factor as sqrt((n/x) / (2 pi y)), free of
  // overflow, rather than through logarithms near 690, whose rounding would
  // cost the density 1e-13.
  if (*f == 0.0 && x >= 1.0 && y >= 1.0 && y <= kLargeDirect) *f = std::sqrt((n / x) / (k2Pi * y));
  return core;
}

// The beta density at u: (a + b - 1) times a binomial mass of a - 1 in
// a + b - 2 trials for shapes of at least 1; otherwise the mass of a in
// a + b trials times a b / ((a + b) p q).
double betaAt(const UnitPoint& u, double a, double b) {
  double f = 0.0, lf = 0.0, core = 0.0;
  // Shapes from 2^53 on, where a - 1 rounds, take the second form.
  if (a >= 1.0 && b >= 1.0 && a < 0x1p53 && b < 0x1p53) {
    core = binomialCore(a - 1.0, b - 1.0, u, &f, &lf);
    const double c = a + b - 1.0;
    lf += checkedLog(c);
    f *= c;
  } else {
    core = binomialCore(a, b, u, &f, &lf);
    lf += checkedLog(a) + checkedLog(b) - checkedLog(a + b) - u.lp - u.lq;
    const bool large = f > 0.0 && b <= kLargeDirect && u.p * u.q >= 1e-8;
    f = direct({a, b, u.p, u.q}) || large ? f * (a / (a + b)) * (b / (u.p * u.q)) : 0.0;
  }
  return scaledExp(core, f, lf);
}

}  // namespace

// x^(a-1) e^-x / Gamma(a) at x = d / scale, over scale: a Poisson mass of
// mean x at a - 1 (or at a, times a / x, for a < 1).
double gammaDensity(double d, double shape, double scale) {
  if (!(d > 0.0)) return 0.0;
  const double ls = checkedLog(scale), lz = checkedLog(d) - ls;
  const double z = lz > 708.0 ? HUGE_VAL : lz < -708.0 ? 0.0 : d / scale;
  // z^(shape-1) e^-z / Gamma(shape) as the Poisson mass at shape - 1, or, for
  // a shape below 1 or beyond 2^53 (where shape - 1 rounds), as shape/z times
  // the mass at shape.
  const bool byShape = shape < 1.0 || shape >= 0x1p53;
  const double k = byShape ? shape : shape - 1.0;
  double core = -z, lf = -ls, f = 1.0 / scale;
  if (k > 0.0) {
    core = -stirlerr(k) - deviance(k, z, lz);
    lf -= kLnSqrt2Pi + 0.5 * checkedLog(k);
    f = direct({k, scale}) ? f / std::sqrt(k2Pi * k) : 0.0;
  }
  if (byShape) {
    lf += checkedLog(shape) - lz;
    f = direct({shape, z, scale}) ? f * (shape / z) : 0.0;
  }
  return scaledExp(core, f, lf);
}

double betaDensity(double x, double a, double b) {
  if (!(x > 0.0 && x < 1.0)) return 0.0;
  const UnitPoint u = {x, 1.0 - x, checkedLog(x), std::log1p(-x)};
  return betaAt(u, a, b);
}

namespace {

// e^l, as 0 below the normal range and HUGE_VAL above it.
double boundedExp(double l) {
  return l < -708.0 ? 0.0 : l > 709.0 ? HUGE_VAL : std::exp(l);
}

// The deviance bd0(c, m) with m = c / u, given the relative gap t = u - 1
// and u apart (each formed without cancellation by the caller): c g(t) with
// g(t) = ln(1 + t) - t / (1 + t). Near t = 0 by Loader's series in
// v = (c - m)/(c + m) = t / (2 + t), whose terms have one sign.
double relativeDeviance(double c, double t, double u) {
  const double v = t / (1.0 + u);
  if (std::fabs(v) < 0.5) {
    double s = c * t / u * v;
    double term = 2.0 * c * v;
    const double vv = v * v;
    for (int j = 1; j < 1000; ++j) {
      term *= vv;
      const double next = s + term / (2 * j + 1);
      if (next == s) return next;
      s = next;
    }
    return s;
  }
  // u far below 1: g = 1/u - 1 + ln u, and c / u may leave the double range.
  if (u < 1e-300) {
    const double lu = checkedLog(u);
    if (checkedLog(c) - lu > 709.0) return HUGE_VAL;
    return c / u - c + c * lu;
  }
  const double g = checkedLog(u) - t / u;
  return g > 1.0 && c > DBL_MAX / g ? HUGE_VAL : c * g;
}

}  // namespace

// The F density with m, n degrees of freedom as Loader's binomial form in
// a = m/2, b = n/2, N = a + b at p = m x / (n + m x):
//   f(x) = exp(stirlerr(N) - stirlerr(a) - stirlerr(b) - bd0(a, N p) - bd0(b, N q))
//          sqrt(a b / (2 pi N)) / x.
// The means N p and N q are never formed: a / (N p) = 1 + t and
// b / (N q) = 1 + s with t = (b/N)(1 - x)/x and s = (a/N)(x - 1), exact to
// a few ulps however large the degrees of freedom (a rounded N p would put
// an error of N eps into a deviance that must be known to 1e-15).
double fDensity(double x, double m, double n) {
  if (!(x > 0.0)) return 0.0;
  const double a = 0.5 * m, b = 0.5 * n, N = a + b;
  const double wa = a / N, wb = b / N, lx = checkedLog(x);
  // 1 + t = wa + wb / x and 1 + s = wb + wa x. A weight below DBL_MIN (a
  // shape of 1e-300 beside one of 1e10) is not negligible beside the other
  // term when x is as small or as large: those terms go through logarithms.
  double wbOverX = wb / x, waTimesX = wa * x, ut = wa + wbOverX, us = wb + waTimesX;
  double t = wb * ((1.0 - x) / x), s = wa * (x - 1.0);
  if (wb < DBL_MIN) {
    const double la = checkedLog(a), lb = checkedLog(b);
    wbOverX = boundedExp(lb - checkedLog(N) - lx);
    t = wbOverX * (1.0 - x);
    ut = wa + wbOverX;
    us = waTimesX * (1.0 + boundedExp(lb - la - lx));
  } else if (wa < DBL_MIN) {
    const double la = checkedLog(a), lb = checkedLog(b);
    waTimesX = boundedExp(la + lx - checkedLog(N));
    s = waTimesX;
    us = wb + waTimesX;
    ut = wbOverX * (1.0 + boundedExp(la + lx - lb));
  }
  const double core = stirlerr(N) - stirlerr(a) - stirlerr(b) - relativeDeviance(a, t, ut) -
                      relativeDeviance(b, s, us);
  const double lf = 0.5 * (checkedLog(a) + checkedLog(b) - checkedLog(N)) - kLnSqrt2Pi - lx;
  // wa b <= b: no overflow for any b up to 1e300 (logarithms near 690
  // would cost 1e-13).
  const bool large = wa >= kDirectLow && b <= kLargeDirect && x >= kDirectLow && x <= kDirectHigh;
  const double f = direct({wa, b, x}) || large ? std::sqrt(wa * b / k2Pi) / x : 0.0;
  return scaledExp(core, f, lf);
}

// Gamma(u) / (Gamma(v) sqrt(n pi)) (1 + x^2/n)^-u with u = (n+1)/2,
// v = n/2. Stirling's formula for both gamma functions gives
// Gamma(u)/Gamma(v) = sqrt(v) exp(stirlerr(u) - stirlerr(v) - bd0(v, u)),
// the deviance bd0(v, u) = v ln(v/u) + u - v collecting the powers.
double tDensity(double x, double n) {
  const double u = (n + 1.0) / 2.0, v = n / 2.0;
  const double ax = std::fabs(x), sn = std::sqrt(n);
  // ln(1 + r^2) with r = |x| / sqrt(n), without forming r or r^2 where
  // they would overflow.
  double lg = 0.0;
  if (ax / 1e150 > sn) {
    lg = 2.0 * (checkedLog(ax) - checkedLog(sn));
  } else {
    const double r = ax / sn;
    lg = r > 1e100 ? 2.0 * checkedLog(r) : std::log1p(r * r);
  }
  const double exponent = stirlerr(u) - stirlerr(v) - bd0(v, u) - u * lg;
  return checkedExp(exponent - kLnSqrt2Pi);
}

double hypergeometricMass(double k, double N, double M, double n) {
  const double p = n / N, q = (N - n) / N;
  const double a = binomialMass(k, M, p, q);
  const double b = binomialMass(n - k, N - M, p, q);
  const double c = binomialMass(n, N, p, q);
  return a * b / c;
}

}  // namespace saddle
}  // namespace qel
