// Closed saddle-point form of the far lower tail of the noncentral t,
// P(T <= t) for T = (Z + delta)/sqrt(V/df), uniform in the tail (Temme's
// treatment of an integral with an end point). With x = t/sqrt(df),
// d = delta/sqrt(df), Y = Z/sqrt(df) and W = sqrt(V/df), the tail is the mass
// of the density of (W, Y), proportional to
//   w^(df-1) exp(-df (w^2 + y^2)/2),
// on the half-plane s = y - x w <= -d. For fixed s the integral over w is of
// Laplace type with its stationary point w*(s), the root of
// x (s + x w) + w - 1/w = 0; at s = -d that is the saddle
//   r = (x d + sqrt(x^2 d^2 + 4 (1 + x^2))) / (2 (1 + x^2)).
// The outer variable eta = sqrt(psi(s)), psi = (s + x w*)^2 + w*^2 -
// ln(w*^2) - 1, turns the outer integral exactly into
//   int_W^inf exp(-df eta^2/2) H(eta) d eta,  W = sqrt(h),
//   h = u^2 + r^2 - ln(r^2) - 1,  u = d - x r,
// and H is expanded at the end point eta = W to second order:
//   P = lead [Q + (c1/sqrt df)(f - z Q) + (c2/df)((1 + z^2) Q - z f)],
// z = W sqrt(df), Q and f the upper normal tail and density at z,
// c1 = H'/H, c2 = H''/(2H), and lead = C H(W) (1 + A/df) with A the first
// correction of the inner Laplace integral. tools/reference/derive_t_saddle.py
// derives c1, c2 and A (written here in p = r x and k = 1 + r^2 + p^2, which
// stay bounded for any t) and shows the relative error falling like df^-2:
// about 1e-4 at df = 10, 1e-8 at df = 1000, 1e-12 at df = 1e5.
#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/t_internal.h"

namespace {

using namespace qel::elv;

constexpr double kSqrt2Pi = 2.5066282746310007;
constexpr double kLnSqrt2Pi = 0.91893853320467274;

// e - ln(1 + e), which cancels to e^2/2 for small e.
double excessOverLog(double e) {
  if (std::fabs(e) > 0.1) return e - std::log1p(e);
  double sum = 0.0, power = e * e;
  for (int k = 2; k < 40; ++k) {
    sum += (k % 2 == 0 ? power : -power) / k;
    power *= e;
  }
  return sum;
}

// The normal tail at z > 0 as ln Q(z) and g = f(z)/Q(z) - z, the latter
// free of cancellation: erfc below 5, above it the continued fraction
// g = 1/(z + 2/(z + 3/(z + ...))) of the Mills ratio.
struct NormalTail {
  double logQ, g;
};

NormalTail normalTail(double z) {
  if (z < 5.0) {
    const double q = 0.5 * std::erfc(z * 0.70710678118654752);
    const double f = std::exp(-0.5 * z * z) / kSqrt2Pi;
    return {std::log(q), f / q - z};
  }
  double fraction = z;
  for (int k = 100; k >= 2; --k) fraction = z + k / fraction;
  const double g = 1.0 / fraction;
  return {-0.5 * z * z - kLnSqrt2Pi - std::log(z + g), g};
}

// Coefficients of the end-point expansion, from derive_t_saddle.py.
struct Coefficients {
  double c1, c2;
};

Coefficients coefficients(double p, double r, double u, double W) {
  const double p2 = p * p, r2 = r * r, k = 1.0 + r2 + p2, m = k - 1.0;
  const double W2 = W * W, u2 = u * u;
  const double c1 =
      (u * k * (p * (r2 - 1.0) + u * (r2 + 1.0)) - W2 * ((r2 + 1.0) * k + p * u * m)) /
      (W * u2 * k * k);
  const double b = 3.0 * r2 * k + 5.0 * p2;
  const double onePlusR2 = r2 + 1.0;
  const double e = 2.0 * p2 * p2 * r2 - 4.0 * p2 * p2 + 5.0 * p2 * r2 * r2 - p2 * r2 + 4.0 * p2 +
                   3.0 * onePlusR2 * onePlusR2 * onePlusR2;
  const double numerator = 3.0 * W2 * onePlusR2 * onePlusR2 * k * k + W2 * u * p * k * b +
                           W2 * u2 * p2 * m * (2.0 * m - 3.0) -
                           4.0 * u * p * (r2 - 1.0) * onePlusR2 * k * k - u2 * k * e -
                           u2 * u * p * k * b;
  const double k2 = k * k;
  return {c1, numerator / (2.0 * u2 * u2 * k2 * k2)};
}

}  // namespace

extern "C" {

double t_saddle_approx(double t, double df, double delta) {
  SaddleStart s;
  double answer;
  if (saddleShortcut(t, df, delta, &s, &answer)) return answer;
  const double sqrtDf = s.sqrtDf, x = s.x, d = s.d, r = s.r;
  const double u = d - x * r;
  // The end point must lie beyond the mode of (W, Y), on the side of the
  // lower tail (u > 0): for t >= 0 with small delta, or delta <= 0, the
  // form has no tail to describe and its value, of the wrong sign, is
  // raised to 0.
  if (!(u > 0.0)) return 0.0;
  const double W = std::sqrt(u * u + excessOverLog((r - 1.0) * (r + 1.0)));
  const double z = W * sqrtDf;
  // ln Q(z) below -z^2/2 - ln z: far below the cut long before z^2
  // overflows.
  if (z > 1e150) return 0.0;
  const double p = r * x, k = 1.0 + r * r + p * p;
  // The expansion terms hold u^-4 (c2) and u^-2 (c1): once u^4 leaves the
  // double range their logarithm fails the underflow test and they are
  // dropped, leaving the leading term (z is then tiny and P near 1/2).
  Coefficients c{0.0, 0.0};
  if (4.0 * std::log(u) > underflowLog()) c = coefficients(p, r, u, W);
  const NormalTail tail = normalTail(z);
  const double bracket = 1.0 + c.c1 / sqrtDf * tail.g + c.c2 / df * (1.0 - z * tail.g);
  const double A = (12.0 * k * k - 21.0 * k + 10.0) / (12.0 * k * k * k);
  const double correction = 1.0 + A / df;
  if (!(bracket > 0.0) || !(correction > 0.0)) return 0.0;
  // lead = 2 (df/2)^(df/2) e^(-df/2)/Gamma(df/2) sqrt(2 pi/df) H(W), with
  // H(W) = W/(u sqrt(k)).
  const double halfDf = 0.5 * df;
  const double logLead = std::log(2.0 * halfDf) - ln_scaled_gamma(halfDf) +
                         0.5 * std::log(2.0 * M_PI / df) + std::log(W / u) - 0.5 * std::log(k) +
                         std::log(correction);
  const double logResult = logLead + tail.logQ + std::log(bracket);
  if (logResult < underflowLog()) return 0.0;
  const double result = std::exp(logResult);
  return result > 1.0 ? 1.0 : result;
}

}  // extern "C"
