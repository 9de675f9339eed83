// Complementary Owen's T function for the noncentral t routines:
//   Tha_c(h, a) = integral from h to infinity of phi(x) Q(a x) dx
//              = Q(h)/2 - T(h, a),   a > 0,
// with Q the upper normal tail and T Owen's function (Owen, 1956). It is the
// probability P(X > h, Y > a X) of two independent standard normals, and it
// is needed with full relative accuracy when it is tiny (the far lower tail
// of the noncentral t with one degree of freedom).
//
// The integrand phi(x) Q(a x) is smooth, positive and log-concave; it is
// integrated by Gauss-Legendre panels that widen geometrically away from h,
// with the first panel matched to the decay rate h (1 + a^2) of the
// integrand, so that every panel holds a smooth, slowly varying piece. The
// relation Tha_c(h, a) + Tha_c(a h, 1/a) = Q(h) Q(a h) moves a steep
// integrand (a > 1) to the flat side when that side is not the smaller one,
// and four regions of a decide which form is used:
//   a > 4/3      : the direct integral;
//   3/4 <= a <= 1: the direct integral (both forms are flat);
//   1 < a <= 4/3 : the reflected value at (a h, 1/a);
//   a < 3/4      : the reflected value at (a h, 1/a).
// The reflected form is used only where Q(h) Q(a h) does not cancel, that
// is, where the reflected integral is the small part of the product.
#include <qel/elv.h>

#include <algorithm>
#include <array>
#include <cmath>

#include "utilities/ELVlimits.h"
#include "utilities/ELVtInternal.h"

namespace {

using namespace qel::elv;

constexpr int kNodes = 20;
constexpr double kInvSqrt2 = 0.70710678118654752;
constexpr double kInvTwoPi = 0.15915494309189534;
constexpr int kMaxPanels = 70;

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

double upperNormal(double x) {
  return 0.5 * std::erfc(x * kInvSqrt2);
}

// phi(x) Q(a x) / (phi(h) Q(a h)), by logarithms so that neither factor
// underflows on its own when the ratio is representable.
double scaledIntegrand(double x, double h, double a, double logBase) {
  const double q = upperNormal(a * x);
  if (q <= 0.0) return 0.0;
  const double logValue = -0.5 * (x - h) * (x + h) + std::log(q) - logBase;
  return logValue < kUnderflowLog ? 0.0 : std::exp(logValue);
}

// Direct integral for h >= 0, with relative accuracy; 4 when the panels do
// not reach the negligible part of the integrand.
int directIntegral(double h, double a, double* out, long* panels) {
  const double qBase = upperNormal(a * h);
  if (qBase <= 0.0) {
    // Q(a h) underflows: phi(h) Q(a h) / (h (1 + a^2)) is below any double.
    *out = 0.0;
    *panels = 0;
    return 0;
  }
  const double logBase = std::log(qBase);
  const double rate = h * (1.0 + a * a) + std::sqrt(1.0 + a * a);
  double width = 0.5 / rate;
  double start = h, sum = 0.0;
  const GaussLegendre& gl = rule();
  for (int panel = 1; panel <= kMaxPanels; ++panel) {
    const double half = 0.5 * width, centre = start + half;
    double part = 0.0;
    for (int i = 0; i < kNodes; ++i) {
      part += gl.weight[i] * scaledIntegrand(centre + half * gl.node[i], h, a, logBase);
    }
    part *= half;
    sum += part;
    start += width;
    width *= 1.6;
    if (part <= 1e-17 * sum) {
      *out = sum * qBase * phi(h);
      *panels = panel;
      return 0;
    }
  }
  *panels = kMaxPanels;
  return 4;
}

// Tha_c for h >= 0 and a > 0, region by region.
int nonNegativeH(double h, double a, double* out, long* panels) {
  if (a > 1.333333 || (a >= 0.75 && a <= 1.0)) return directIntegral(h, a, out, panels);
  double reflected = 0.0;
  const int code = directIntegral(a * h, 1.0 / a, &reflected, panels);
  if (code != 0) return code;
  *out = upperNormal(h) * upperNormal(a * h) - reflected;
  // Cancellation guard: the reflected part must not dominate the product.
  if (*out < 0.25 * reflected) return directIntegral(h, a, out, panels);
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
    *out = (h < 0.0 ? 0.5 - upperNormal(-h) : 0.0) + (h <= 0.0 ? kInvTwoPi / a : 0.0);
    ELVsteps1 = 0;
    return 0;
  }
  long panels = 0;
  int code;
  if (h >= 0.0) {
    code = nonNegativeH(h, a, out, &panels);
  } else {
    // Over [h, 0) the integrand is bounded away from 0: one finite integral
    // plus the value at 0, atan(1/a)/(2 pi).
    const GaussLegendre& gl = rule();
    const int pieces = static_cast<int>(std::min(1.0 + std::fabs(h) * (1.0 + a), 400.0));
    const double width = -h / pieces;
    double sum = 0.0;
    for (int p = 0; p < pieces; ++p) {
      const double centre = h + (p + 0.5) * width;
      for (int i = 0; i < kNodes; ++i) {
        const double x = centre + 0.5 * width * gl.node[i];
        sum += gl.weight[i] * phi(x) * upperNormal(a * x);
      }
    }
    *out = 0.5 * width * sum + std::atan(1.0 / a) * kInvTwoPi;
    panels = pieces;
    code = 0;
  }
  ELVsteps1 = panels;
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
