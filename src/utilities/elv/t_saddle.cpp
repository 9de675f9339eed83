// Far lower tail of the noncentral t for t < 0 < delta, where the Poisson
// mixture loses the tail to cancellation. With x = t/sqrt(df),
// d = delta/sqrt(df) and W = sqrt(V/df) for V chi-square with df degrees of
// freedom,
//   P(T <= t) = E[ Phi(sqrt(df) (x W - d)) ],
// a one-dimensional integral whose integrand, in logarithms,
//   df (ln w - w^2/2 - (x w - d)^2/2) + lower order terms,
// has its saddle at r = (x d + sqrt(x^2 d^2 + 4 (1 + x^2))) / (2 (1 + x^2)).
// Two evaluations are kept:
//  - t_saddle_integral evaluates that integral: Gauss-Legendre panels
//    centred on r with the width of the saddle, 1/sqrt(df (1/r^2 + 1 +
//    x^2)), widening outward until the rest is negligible. The integrand is
//    scaled by its value at the saddle, so that tails far below the
//    smallest normal double keep relative accuracy until the final product
//    underflows. Relative error about 1e-13 at every df.
//  - t_saddle_approx is the closed uniform (Temme-type) expansion of the
//    same integral to order 1/df; its relative error falls like df^-2
//    (tools/reference/derive_t_saddle.py derives it and measures it).
#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/t_internal.h"

namespace {

using namespace qel::elv;

constexpr double kInvSqrt2 = 0.70710678118654752;
constexpr double kLnSqrt2Pi = 0.91893853320467274;
constexpr int kPanelsPerSide = 80;

// Gauss-Legendre, 16 points on [-1, 1].
constexpr double kNode[8] = {0.0950125098376374, 0.2816035507792589, 0.4580167776572274,
                             0.6178762444026438, 0.7554044083550030, 0.8656312023878318,
                             0.9445750230732326, 0.9894009349916499};
constexpr double kWeight[8] = {0.1894506104550685, 0.1826034150449236, 0.1691565193950025,
                               0.1495959888165767, 0.1246289712555339, 0.0951585116824928,
                               0.0622535239386479, 0.0271524594117541};

// ln Phi(y): erfc where it does not underflow, else the continued fraction
// of the Mills ratio Q(z)/phi(z) = 1/(z + 1/(z + 2/(z + ...))).
double logLowerNormal(double y) {
  if (y > -25.0) return std::log(0.5 * std::erfc(-y * kInvSqrt2));
  const double z = -y;
  double fraction = z;
  for (int k = 60; k >= 1; --k) fraction = z + k / fraction;
  return -0.5 * z * z - kLnSqrt2Pi - std::log(fraction);
}

// The integrand in s = ln w (dw = w ds), which removes the power
// singularity of the chi density at w = 0 for small df.
struct Integrand {
  double df, x, d, logScale;
  // ln of the chi density of W (without its constant) times w, plus ln Phi.
  double logValue(double s) const {
    const double w = std::exp(s);
    return df * s - 0.5 * df * (w - 1.0) * (w + 1.0) + logLowerNormal(std::sqrt(df) * (x * w - d));
  }
  double scaled(double s) const {
    const double v = logValue(s) - logScale;
    return v < underflowLog() ? 0.0 : std::exp(v);
  }
};

double panel(const Integrand& f, double from, double to) {
  const double half = 0.5 * (to - from), centre = 0.5 * (to + from);
  double sum = 0.0;
  for (int i = 0; i < 8; ++i) {
    sum += kWeight[i] * (f.scaled(centre - half * kNode[i]) + f.scaled(centre + half * kNode[i]));
  }
  return half * sum;
}

}  // namespace

namespace qel {
namespace elv {

bool saddleShortcut(double t, double df, double delta, SaddleStart* start, double* answer) {
  ELVsteps1 = ELVsteps2 = ELVsteps3 = 0;
  if (anyNan(t, df, delta) || !(df > 0.0 && df <= kMaxDf) || !(std::fabs(t) < kHuge) ||
      !(std::fabs(delta) < 1e6)) {
    *answer = -1.0;
    return true;
  }
  // Beyond this |t| (where the noncentral routine answers 0 or 1 outright)
  // the squares below would overflow.
  if (std::fabs(t) > 1e140) {
    *answer = t < 0.0 ? 0.0 : 1.0;
    return true;
  }
  start->sqrtDf = std::sqrt(df);
  start->x = t / start->sqrtDf;
  start->d = delta / start->sqrtDf;
  start->onePlus = 1.0 + start->x * start->x;
  const double x = start->x, d = start->d;
  start->r = (x * d + std::sqrt(x * x * d * d + 4.0 * start->onePlus)) / (2.0 * start->onePlus);
  return false;
}

double t_saddle_integral(double t, double df, double delta) {
  SaddleStart s;
  double answer;
  if (saddleShortcut(t, df, delta, &s, &answer)) return answer;
  const double x = s.x, d = s.d, onePlus = s.onePlus, r = s.r;
  Integrand f{df, x, d, 0.0};
  const double centre = std::log(r);
  f.logScale = f.logValue(centre);
  // Width of the saddle in s = ln w: that in w over r.
  const double width = 1.0 / (r * std::sqrt(df * (1.0 / (r * r) + onePlus)));

  // Both sides of the saddle, in panels that widen until the rest is
  // negligible.
  double sum = 0.0;
  for (int side = -1; side <= 1; side += 2) {
    double from = centre, step = 0.5 * width;
    for (int i = 0; i < kPanelsPerSide; ++i) {
      const double to = from + side * step;
      const double part = side > 0 ? panel(f, from, to) : panel(f, to, from);
      sum += part;
      from = to;
      step *= 1.5;
      if (part <= 1e-17 * sum) break;
    }
  }
  // Constant of the density of W: 2 (df/2)^(df/2) / Gamma(df/2), with the
  // exp(df/2) that the scaled integrand above leaves out.
  const double halfDf = 0.5 * df;
  const double logConstant = std::log(2.0) + std::log(halfDf) - ln_scaled_gamma(halfDf);
  if (!(sum > 0.0)) return 0.0;
  const double logResult = logConstant + f.logScale + std::log(sum);
  if (logResult < underflowLog()) return 0.0;
  const double result = std::exp(logResult);
  return result > 1.0 ? 1.0 : result;
}

}  // namespace elv
}  // namespace qel
