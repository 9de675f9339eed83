// Pieces shared by the studentized range, maximum and maximum modulus: a
// guarded exponential, the upper normal tail from its density without a
// second exponential, and the log-density of the chi scale factor s in
// t = log s.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_STUDENTIZED_COMMON_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_STUDENTIZED_COMMON_H

#include <algorithm>
#include <cmath>

#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace studentized {

constexpr double kInvSqrt2Pi = 0.39894228040143267794;
constexpr double kSqrtHalf = 0.70710678118654752440;
constexpr double kLog2Pi = 1.83787706640934548356;

// exp(x), 0 below the double range and capped at e^700 (no trap).
inline double safeExp(double x) {
  return x < -745.0 ? 0.0 : std::exp(std::min(x, 700.0));
}

// The standard normal density, 0 where it underflows.
inline double phi(double z) {
  return z * z > 1490.0 ? 0.0 : kInvSqrt2Pi * std::exp(-0.5 * z * z);
}

// Q(y) for y >= 0 from phi(y), without exp: erfc by the rational
// approximations of ACM TOMS 708 (Didonato and Morris, 1992; routines ERF
// and ERFC1), highest power first: erfc(u) = 1 - u a(u^2)/b(u^2) for
// u <= 1/2, e^(u^2) erfc(u) = p(u)/q(u) for 1/2 < u <= 4 and
// (1/sqrt(pi) - t r(t)/s(t))/u, t = 1/u^2, beyond; within 3e-15 of erfc for
// u in [0, 26]. With u = y/sqrt(2), Q(y) = sqrt(pi/2) phi(y) e^(u^2) erfc(u).
inline double upperNormalFromDensity(double y, double phiY) {
  static const double a[5] = {.771058495001320e-04, -.133733772997339e-02, .323076579225834e-01,
                              .479137145607681e-01, .128379167095513e+00};
  static const double b[3] = {.301048631703895e-02, .538971687740286e-01, .375795757275549e+00};
  static const double p[8] = {-1.36864857382717e-07, 5.64195517478974e-01, 7.21175825088309e+00,
                              4.31622272220567e+01,  1.52989285046940e+02, 3.39320816734344e+02,
                              4.51918953711873e+02,  3.00459261020162e+02};
  static const double q[8] = {1.00000000000000e+00, 1.27827273196294e+01, 7.70001529352295e+01,
                              2.77585444743988e+02, 6.38980264465631e+02, 9.31354094850610e+02,
                              7.90950925327898e+02, 3.00459260956983e+02};
  static const double r[5] = {2.10144126479064e+00, 2.62370141675169e+01, 2.13688200555087e+01,
                              4.65807828718470e+00, 2.82094791773523e-01};
  static const double s[4] = {9.41537750555460e+01, 1.87114811799590e+02, 9.90191814623914e+01,
                              1.80124575948747e+01};
  constexpr double kSqrtHalfPi = 1.25331413731550025121;
  constexpr double kInvSqrtPi = .564189583547756e+00;
  const double u = y * kSqrtHalf;
  if (u <= 0.5) {
    const double t = u * u;
    const double top = (((a[0] * t + a[1]) * t + a[2]) * t + a[3]) * t + a[4] + 1.0;
    const double bot = ((b[0] * t + b[1]) * t + b[2]) * t + 1.0;
    return 0.5 * (0.5 + (0.5 - u * (top / bot)));
  }
  double scaled = 0.0;
  if (u <= 4.0) {
    // Estrin's scheme: a third of Horner's chain of dependent operations,
    // so that the tails of neighbouring arguments overlap in the pipeline.
    const double u2 = u * u, u4 = u2 * u2;
    const double top = ((p[0] * u + p[1]) * u2 + (p[2] * u + p[3])) * u4 +
                       ((p[4] * u + p[5]) * u2 + (p[6] * u + p[7]));
    const double bot = ((q[0] * u + q[1]) * u2 + (q[2] * u + q[3])) * u4 +
                       ((q[4] * u + q[5]) * u2 + (q[6] * u + q[7]));
    scaled = top / bot;
  } else {
    const double t = 1.0 / (u * u);
    const double top = (((r[0] * t + r[1]) * t + r[2]) * t + r[3]) * t + r[4];
    const double bot = (((s[0] * t + s[1]) * t + s[2]) * t + s[3]) * t + 1.0;
    scaled = (kInvSqrtPi - t * top / bot) / u;
  }
  return kSqrtHalfPi * phiY * scaled;
}

// Q(y) = P(N > y) for any y by the path above (0 where it underflows).
inline double fastUpperNormal(double y) {
  if (y >= 0.0) return upperNormalFromDensity(y, phi(y));
  return 1.0 - upperNormalFromDensity(-y, phi(y));
}

// e^u - 1 - u without cancellation (1e300 beyond the exp range).
inline double expm1MinusU(double u) {
  if (std::fabs(u) >= 0.5) return u > 700.0 ? 1e300 : std::expm1(u) - u;
  double term = 0.5 * u * u, sum = term;
  for (int n = 3; n < 30 && std::fabs(term) > 1e-18 * sum; ++n) {
    term *= u / n;
    sum += term;
  }
  return sum;
}

// log g(t) = c0 - x (e^(2t) - 1 - 2t), x = df/2, the density of t = log s
// for s = sqrt(chi2_df / df), with
// c0 = log 2 + x log x - x - log Gamma(x) = log 2 + log(x)/2 - log(2 pi)/2 - d(x),
// d(x) the remainder of Stirling's series, so that very large df keeps its
// accuracy.
struct LogChi {
  explicit LogChi(double df) : x(0.5 * df) {
    double d = 0.0;
    if (x >= 15.0) {
      const double r = (1.0 / x) * (1.0 / x);
      d = (1.0 / 12.0 - r * (1.0 / 360.0 - r * (1.0 / 1260.0 - r / 1680.0))) / x;
    } else {
      // log Gamma(x) = -log x - gamma x + O(x^2) below x = 1e-8.
      const double logGamma = x < 1e-8 ? -std::log(x) - 0.57721566490153286061 * x : mLogGamma(x);
      d = logGamma - ((x - 0.5) * std::log(x) - x + 0.5 * kLog2Pi);
    }
    c0 = std::log(2.0) + 0.5 * std::log(x) - 0.5 * kLog2Pi - d;
  }
  double operator()(double t) const {
    const double e = expm1MinusU(2.0 * t);
    return e > 1e300 / std::max(1.0, x) ? -1e300 : c0 - x * e;
  }
  double x, c0;
};

}  // namespace studentized
}  // namespace qel

#endif
