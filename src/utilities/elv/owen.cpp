// Complementary Owen's T function for the noncentral t routines:
//   Tha_c(h, a) = integral from h to infinity of phi(x) Q(a x) dx
//              = Q(h)/2 - T(h, a),   a > 0,
// with Q the upper normal tail and T Owen's function (Owen, 1956). It is the
// probability P(X > h, Y > a X) of two independent standard normals, and it
// is needed with full relative accuracy when it is tiny (the far lower tail
// of the noncentral t with one degree of freedom).
//
// For h >= 0, T(h, inf) = Q(h)/2 and dT/da = exp(-h^2 (1 + a^2)/2)/(2 pi (1 + a^2))
// give
//   Tha_c(h, a) = 1/(2 pi) integral_a^inf exp(-h^2 (1 + t^2)/2)/(1 + t^2) dt,
// and the reflection Tha_c(h, a) + Tha_c(a h, 1/a) = Q(h) Q(a h). Two series
// of this integral, of the kind Owen (1956) and Patefield and Tandy (2000)
// use, cover four regions of a:
//   a > 1.333333      : the gamma series (expansion of 1/(1 + t^2) in 1/t^2);
//   0.75 <= a <= 1    : the double series about a = 1, in w = 1 - a;
//   1 < a <= 1.333333 : Q(h) Q(a h) minus the double series at (a h, 1/a);
//   a < 0.75          : Q(h) Q(a h) minus the gamma series at (a h, 1/a).
// The reflected value is at most about 2/3 of Q(h) Q(a h) in both reflected
// regions, so the difference loses at most two bits. The series and their
// scaled forms are derived and checked in tools/reference/derive_owen_series.py.
//
// The double series needs about h^2 (2w - w^2)/2 terms before it decays, and
// its inner alternating sum cancels like ((1 + w/2)/(1 - w/2))^n. Where 200
// terms do not reach 1e-15, or its rounding error bound exceeds that (h above
// about 4.5 at a = 0.75, 9 at a = 0.9, 26.5 for any a but 1), the integral
// is evaluated by Gauss-Legendre panels instead, which keep 1e-15 there since
// the integrand is a smooth, nearly exponential decay; `ELVsteps1` then holds
// the number of panels instead of the number of terms.
//
// The incomplete gamma values are formed here to 1e-16 (Gamma(1/2, g) from
// erfc, the others from a continued fraction run to convergence), as the
// scaled series of the gamma kernels stop at 1e-9.
#include <qel/elv.h>

#include <algorithm>
#include <array>
#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/t_internal.h"

namespace {

using namespace qel::elv;

constexpr int kNodes = 20;
constexpr double kInvSqrt2 = 0.7071067811865476;
constexpr double kInvSqrt2Lo = -4.833646656726457e-17;  // 1/sqrt(2) - kInvSqrt2
constexpr double kInvSqrtPi = 0.5641895835477563;
constexpr double kInvSqrtTwoPi = 0.3989422804014327;
constexpr double kInvTwoPi = 0.15915494309189534;
constexpr double kFourPi = 12.566370614359172;
constexpr double kSqrtPi = 1.7724538509055160;
constexpr double kTolerance = 1e-15;
constexpr int kMaxPanels = 70;
constexpr int kMaxGammaTerms = 70;
constexpr int kMaxDoubleTerms = 200;
constexpr int kMaxFractionSteps = 500;
// Q(38.5) is below the smallest subnormal double.
constexpr double kNormalTailEnd = 38.5;
// e^-h^2 stays a normal double in the double series.
constexpr double kMaxSquareInDouble = 700.0;

struct GaussLegendre {
  std::array<double, kNodes> node{}, weight{};
  GaussLegendre() {
    // Roots of P_n by Newton's method from the Chebyshev guesses.
    for (int i = 0; i < kNodes; ++i) {
      double x = std::cos(3.141592653589793 * (i + 0.75) / (kNodes + 0.5));
      double dp = 1.0;
      for (int iteration = 0; iteration < 100; ++iteration) {
        double p0 = 1.0, p1 = x;
        for (int k = 2; k <= kNodes; ++k) {
          const double p2 = ((2.0 * k - 1.0) * x * p1 - (k - 1.0) * p0) / k;
          p0 = p1;
          p1 = p2;
        }
        dp = kNodes * (x * p1 - p0) / (x * x - 1.0);
        const double step = p1 / dp;
        x -= step;
        if (std::fabs(step) < 1e-16) break;
      }
      node[i] = x;
      weight[i] = 2.0 / ((1.0 - x * x) * dp * dp);
    }
  }
};

const GaussLegendre& rule() {
  static const GaussLegendre gl;
  return gl;
}

// A value carried as the unevaluated sum hi + lo, for products such as a h
// whose rounding would otherwise cost (a h)^2 ulps in exp(-(a h)^2/2).
struct Exact {
  double hi, lo;
};

Exact product(double x, double y) {
  const double p = x * y;
  return {p, std::fma(x, y, -p)};
}

// Q(x + lo) with the rounding of x/sqrt(2) and lo carried to first order, so
// that the tail keeps its relative accuracy for large x.
double upperNormal(double x, double lo = 0.0) {
  const double z = x * kInvSqrt2;
  const double q = 0.5 * std::erfc(z);
  if (std::fabs(z) > 40.0) return q;
  const double zLo = std::fma(x, kInvSqrt2, -z) + x * kInvSqrt2Lo + lo * kInvSqrt2;
  return q - kInvSqrtPi * std::exp(-z * z) * zLo;
}

double upperNormal(Exact x) {
  return upperNormal(x.hi, x.lo);
}

// exp(-(x^2 + y^2)/2) with the squares split exactly, for x^2 + y^2 below
// about 3000 (beyond, the result underflows anyway).
double gaussianPair(Exact x, Exact y) {
  const Exact xx = product(x.hi, x.hi), yy = product(y.hi, y.hi);
  const double s = xx.hi + yy.hi;
  const double b = s - xx.hi;
  const double sLo =
      (xx.hi - (s - b)) + (yy.hi - b) + xx.lo + yy.lo + 2.0 * (x.hi * x.lo + y.hi * y.lo);
  return std::exp(-0.5 * s) * std::exp(-0.5 * sLo);
}

// Direct integral of phi(x) Q(a x) over [h, inf) for h >= 0, by panels that
// widen geometrically away from h, the first matched to the decay rate
// h (1 + a^2). The integrand is carried relative to phi(h) Q(a h) as a ratio
// of tails, which keeps full relative accuracy (a ratio of logarithms of
// size (a h)^2/2 would lose their absolute error). 4 when the panels do not
// reach the negligible part of the integrand.
int directIntegral(double h, double a, double* out, long* panels) {
  const double qBase = upperNormal(product(a, h));
  if (qBase <= 0.0) {
    *out = 0.0;
    *panels = 0;
    return 0;
  }
  const double rate = h * (1.0 + a * a) + std::sqrt(1.0 + a * a);
  double width = 0.5 / rate;
  // Nodes are placed by their offset u from h, and a (h + u) is carried
  // exactly: a node rounded to x would move the integrand by h (1 + a^2)
  // ulps of x.
  const Exact ah = product(a, h);
  double offset = 0.0, sum = 0.0;
  const GaussLegendre& gl = rule();
  for (int panel = 1; panel <= kMaxPanels; ++panel) {
    const double half = 0.5 * width;
    double part = 0.0;
    for (int i = 0; i < kNodes; ++i) {
      const double u = offset + half * (1.0 + gl.node[i]);
      const double decay = -0.5 * u * (2.0 * h + u);
      if (decay > kUnderflowLog) {
        const Exact au = product(a, u);
        const double y = ah.hi + au.hi, b = y - ah.hi;
        const double yLo = (ah.hi - (y - b)) + (au.hi - b) + ah.lo + au.lo;
        part += gl.weight[i] * std::exp(decay) * (upperNormal(y, yLo) / qBase);
      }
    }
    part *= half;
    sum += part;
    offset += width;
    width *= 1.6;
    if (part <= 1e-17 * sum) {
      *out = sum * qBase * kInvSqrtTwoPi * gaussianPair({h, 0.0}, {0.0, 0.0});
      *panels = panel;
      return 0;
    }
  }
  *panels = kMaxPanels;
  return 4;
}

// G(s, x) = e^x x^-s Gamma(s, x) for x > 1 by the even part of Legendre's
// continued fraction, 1/(x + 1 - s - 1 (1 - s)/(x + 3 - s - 2 (2 - s)/...)).
// Lentz's forward method finds the depth at which the fraction has
// converged; the value is then taken from a backward evaluation to that
// depth, which keeps the rounding to a few ulps where the forward product of
// a hundred ratios would collect ten times more.
double scaledUpperGamma(double s, double x) {
  constexpr double tiny = 1e-300;
  double f = x + 1.0 - s, c = f, d = 0.0;
  int depth = kMaxFractionSteps;
  for (int n = 1; n <= kMaxFractionSteps; ++n) {
    const double an = -n * (n - s), bn = x + 2.0 * n + 1.0 - s;
    d = bn + an * d;
    if (std::fabs(d) < tiny) d = tiny;
    c = bn + an / c;
    if (std::fabs(c) < tiny) c = tiny;
    d = 1.0 / d;
    const double delta = c * d;
    f *= delta;
    if (std::fabs(delta - 1.0) < 1e-16) {
      depth = n + 2;
      break;
    }
  }
  double tail = x + 2.0 * depth + 1.0 - s;
  for (int m = depth - 1; m >= 0; --m)
    tail = (x + 2.0 * m + 1.0 - s) - (m + 1.0) * (m + 1.0 - s) / tail;
  return 1.0 / tail;
}

// Gamma series for a > 1 at g = (a h)^2/2, h >= 0:
//   Tha_c = phi(h) sum_k [-1/(2 h sqrt(pi))] (-h^2/2)^(k+1) Gamma(-k-1/2, g),
// carried as e^(-(h^2 + (a h)^2)/2)/(4 pi) times
//   S = sum_k (-1)^k a^(-2k-1) G_k,  G_k = g^(k+1/2) e^g Gamma(-k-1/2, g),
// so that neither the powers of h nor the incomplete gamma values overflow
// and h = 0 needs no division. The G_k are bounded (1/(k+1/2) at g = 0). For
// g <= 1 they follow from Gamma(1/2, g) = sqrt(pi) erfc(sqrt(g)) by the
// recurrence of the incomplete gamma, G_k = (1 - g G_(k-1))/(k + 1/2), which
// is stable there; for g > 1 each is a continued fraction. The terms fall at
// least like 1/a^2. Returns S, or 4 in *code after 70 terms.
double gammaSum(double g, double a, long* terms, int* code) {
  const double invA2 = 1.0 / (a * a);
  double gPrevious = 0.0;  // g G_(k-1)
  if (g <= 1.0) {
    const double root = std::sqrt(g);
    gPrevious = root * std::exp(g) * kSqrtPi * std::erfc(root);
  }
  double power = 1.0 / a, sign = 1.0, sum = 0.0;
  for (int k = 0; k < kMaxGammaTerms; ++k) {
    double G;
    if (g <= 1.0) {
      G = (1.0 - gPrevious) / (k + 0.5);
      gPrevious = g * G;
    } else {
      G = scaledUpperGamma(-k - 0.5, g);
    }
    const double term = sign * power * G;
    sum += term;
    power *= invA2;
    sign = -sign;
    if (std::fabs(term) <= kTolerance * std::fabs(sum)) {
      *terms = k + 1;
      *code = 0;
      return sum;
    }
  }
  *terms = kMaxGammaTerms;
  *code = 4;
  return 0.0;
}

// Double series for 0.75 <= a <= 1 at h = x.hi + x.lo >= 0, w = 1 - a:
//   Tha_c = Q(h)^2/2 + (1/(4 pi)) sum_n e^-h^2 c_n I_n,
//   c_n = sum_(j<=n) h^(2j)/j!,  I_n = w^(n+1) sum_m C(n, m) (-w/2)^m/(n+m+1),
// the expansion of the integrand over (a, 1] in s = v (1 - v/2), t = 1 - v.
// The outer terms are positive; the rounding of the inner sums is bounded by
// their absolute sums. 4 when 200 terms, or that bound, do not allow 1e-15.
int doubleSeries(Exact x, double w, double* out, long* terms) {
  const double q = upperNormal(x);
  const double base = 0.5 * q * q;
  *terms = 0;
  if (w == 0.0) {
    *out = base;
    return 0;
  }
  const Exact h2 = product(x.hi, x.hi);
  if (h2.hi > kMaxSquareInDouble) return 4;
  const double baseScaled = kFourPi * base;  // Q(h)^2/2 in the units of the terms
  double poisson = std::exp(-h2.hi) * std::exp(-(h2.lo + 2.0 * x.hi * x.lo));
  double cumulative = 0.0, wPower = w;
  double sum = 0.0, absolute = 0.0, previous = 0.0;
  for (int n = 0; n < kMaxDoubleTerms; ++n) {
    if (n > 0) poisson *= h2.hi / n;
    cumulative += poisson;
    double binomial = 1.0, inner = 1.0 / (n + 1.0), innerAbsolute = inner;
    for (int m = 1; m <= n; ++m) {
      binomial *= -0.5 * w * (n - m + 1.0) / m;
      const double part = binomial / (n + m + 1.0);
      inner += part;
      innerAbsolute += std::fabs(part);
    }
    const double term = cumulative * wPower * inner;
    sum += term;
    absolute += cumulative * wPower * innerAbsolute;
    wPower *= w;
    if (n > 0 && term <= previous && term <= kTolerance * (sum + baseScaled)) {
      if (2.2e-16 * absolute > 0.5 * kTolerance * (sum + baseScaled)) return 4;
      *out = sum / kFourPi + base;
      *terms = n + 1;
      return 0;
    }
    previous = term;
  }
  *terms = kMaxDoubleTerms;
  return 4;
}

// Tha_c for h >= 0 and a > 0, region by region. Both orientations of the
// gamma series share the factor e^(-(h^2 + (a h)^2)/2)/(4 pi); the reflected
// double series runs at the exact a h and w = (a - 1)/a.
int nonNegativeH(double h, double a, double* out, long* terms) {
  if (h >= kNormalTailEnd || a * h >= kNormalTailEnd) {
    // Tha_c <= Q(h) Q(a h), below the smallest double.
    *out = 0.0;
    *terms = 0;
    return 0;
  }
  const Exact ah = product(a, h);
  int code = 0;
  if (a > 1.333333) {
    const double sum = gammaSum(0.5 * ah.hi * ah.hi, a, terms, &code);
    if (code == 0) *out = gaussianPair({h, 0.0}, ah) / kFourPi * sum;
    return code;
  }
  if (a >= 0.75 && a <= 1.0) {
    if (doubleSeries({h, 0.0}, 1.0 - a, out, terms) == 0) return 0;
    return directIntegral(h, a, out, terms);
  }
  double reflected = 0.0;
  if (a < 0.75) {
    const double sum = gammaSum(0.5 * h * h, 1.0 / a, terms, &code);
    reflected = gaussianPair({h, 0.0}, ah) / kFourPi * sum;
  } else {
    code = doubleSeries(ah, (a - 1.0) / a, &reflected, terms);
  }
  if (code != 0) return directIntegral(h, a, out, terms);
  *out = upperNormal(h) * upperNormal(ah) - reflected;
  return 0;
}

}  // namespace

extern "C" {

int Tha_c(double* out, double h, double a) {
  if (isNan(h) || isNan(a) || !(a > 0.0 && a < kHuge)) {
    *out = -1.0;
    return 4;
  }
  // Below -38 the part of the integral left out is under phi(38), 1e-314.
  if (h < -38.0) h = -38.0;
  if (a > 1e100) {
    // Q(a x) is a step at 0: the integral of phi over [h, 0), plus the
    // value atan(1/a)/(2 pi) = 1/(2 pi a) of the range beyond 0.
    *out = (h < 0.0 ? 0.5 * std::erf(-h * kInvSqrt2) : 0.0) + (h <= 0.0 ? kInvTwoPi / a : 0.0);
    ELVsteps1 = 0;
    return 0;
  }
  if (a < 1e-100) {
    // Q(a x) is 1/2 wherever phi(x) matters; T(h, a) is below a/(2 pi).
    *out = 0.5 * upperNormal(h);
    ELVsteps1 = 0;
    return 0;
  }
  long terms = 0;
  int code;
  if (h >= 0.0) {
    code = nonNegativeH(h, a, out, &terms);
  } else {
    // T is even in h, so Tha_c(h, a) = (Q(h) - Q(-h))/2 + Tha_c(-h, a), and
    // for h < 0 the first part is 1/2 - Q(-h) = erf(-h/sqrt(2))/2: a sum of
    // two positive parts, without the cancellation of 1/2 - Q near h = 0.
    code = nonNegativeH(-h, a, out, &terms);
    if (code == 0) *out += 0.5 * std::erf(-h * kInvSqrt2);
  }
  ELVsteps1 = terms;
  if (code != 0) *out = -1.0;
  return code;
}

}  // extern "C"

namespace qel {
namespace elv {

// Lower tail of the noncentral t at t < 0 with delta > 0 for the integer
// part m of df by Owen's (1965) recursion: the integrals
//   M(k) of the t kernel times phi, built upward from M(0) and M(1),
// summed over the odd (with Owen's T) or even (with the normal tail) indices.
// a and b keep the true df; only the number of terms counts by m.
int owenLowerTail(double t, double df, double delta, double* lower) {
  const long m = static_cast<long>(df);
  const double a = t / std::sqrt(df);
  const double b = df / (t * t + df);
  const double s = std::sqrt(b);
  const double d = delta * s;
  double nLower, nUpper;
  normal_df(d * a, &nLower, &nUpper);
  double mPrev2 = s * a * phi(d) * nLower;                                         // M(0)
  double mPrev1 = b * (delta * a * mPrev2 + a * phi(delta) / 2.5066282746310007);  // M(1)
  double evenSum = mPrev2, oddSum = 0.0;
  if (m - 2 >= 1) oddSum += mPrev1;
  double aK = 1.0;  // A(2)
  for (long k = 2; k <= m - 2; ++k) {
    double mk;
    if (k == 2) {
      mk = 0.5 * b * (delta * a * mPrev1 + mPrev2);
    } else {
      aK = 1.0 / ((k - 2) * aK);
      mk = (k - 1) * b * (delta * aK * a * mPrev1 + mPrev2) / k;
    }
    if (k % 2 == 0)
      evenSum += mk;
    else
      oddSum += mk;
    mPrev2 = mPrev1;
    mPrev1 = mk;
  }
  if (m % 2 == 1) {
    double owen;
    if (Tha_c(&owen, d, -a) != 0) return 4;
    *lower = 2.0 * owen + 2.0 * oddSum;
  } else {
    normal_df(delta, &nLower, &nUpper);
    *lower = 2.5066282746310007 * evenSum + nUpper;
  }
  return *lower == -1.0 ? 4 : 0;
}

}  // namespace elv
}  // namespace qel
