// Tails at tiny shapes and tiny arguments (see small_shape_tails.h).
#include "utilities/distributions/small_shape_tails.h"

#include <cfloat>
#include <cmath>
#include <utility>

#include "utilities/distributions/saddle_density.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace smallshape {

namespace {

constexpr double kEuler = 0.57721566490153286061;
constexpr double kZeta2 = 1.6449340668482264365, kZeta3 = 1.2020569031595942854;
constexpr double kZeta4 = 1.0823232337111381915, kZeta5 = 1.0369277551433699263;
// Logarithms below this give a tail under the smallest normal double.
constexpr double kLogSmallest = -708.39;
// Terms below 2^-56 of the sum no longer change it.
constexpr double kRelativeStop = 1.4e-17;

double expOrZero(double v) {
  return v < kLogSmallest ? 0.0 : std::exp(v);
}

// Both tails from the logarithm ln s of the one, s, that the series form.
void fromLog(double logS, bool sIsLower, double* lower, double* upper) {
  const double s = expOrZero(logS);
  const double other = -std::expm1(logS);
  *lower = sIsLower ? s : other;
  *upper = sIsLower ? other : s;
}

// sum_k>=1 c_k z^k / (p + k), c_k = (1 - q)_k / k!, or c_k = 1/k! for the
// gamma series (gammaForm); false after maxTerms terms. The product c_k z^k
// is carried as one factor: c_k alone overflows for a large q, where the
// callers keep q z small.
bool powerSeries(double p, double q, double z, int maxTerms, double* sum, bool gammaForm = false) {
  double cz = 1.0, s = 0.0;
  for (int k = 1; k <= maxTerms; ++k) {
    cz *= gammaForm ? z / k : (k - q) / k * z;
    const double term = cz / (p + k);
    s += term;
    if (std::fabs(term) <= kRelativeStop * std::fabs(s) || cz == 0.0) {
      *sum = s;
      return true;
    }
  }
  return false;
}

// ln(1 + s u)/s: for a tiny s, s u may fall below the normal range, where
// the armed state reads it as 0; the caller multiplies by s last.
double logOnePlusScaled(double s, double u) {
  const double su = s * u;
  return std::fabs(su) < 1e-8 ? u * (1.0 - 0.5 * su) : std::log1p(su) / s;
}

// ln Gamma(1 + a) / a, by its Taylor series (A&S 6.1.33) for a tiny a,
// whose product with a alone could fall below the normal range.
double logGammaOnePlusOverA(double a) {
  return a <= kTinyShape ? -kEuler + a * (kZeta2 / 2.0 - a * kZeta3 / 3.0) : gamln1(a) / a;
}

// D/a, D = ln Gamma(1 + a + b) - ln Gamma(1 + a) - ln Gamma(1 + b) for
// a <= kTinyShape, by the Taylor series of ln Gamma(1 + z) (A&S 6.1.33):
// with both shapes tiny its linear terms cancel exactly, leaving
// a b (zeta(2) - zeta(3)(a + b) + ...), relatively accurate however small;
// otherwise a psi(1 + b) + a^2 psi'(1 + b)/2 + a^3 psi''(1 + b)/6 - ln Gamma(1 + a).
bool logGammaDefectOverA(double a, double b, double* d) {
  if (b <= kTinyShape) {
    const double s = a + b;
    *d = b * (kZeta2 - kZeta3 * s + kZeta4 * (a * a + 1.5 * a * b + b * b) -
              kZeta5 * (a * a * a + 2.0 * a * b * s + b * b * b));
    return true;
  }
  double ans[2] = {0.0, 0.0};
  int nz = 0, ierr = 0;
  XDPSIFN(1.0 + b, 1, 1, 2, ans, &nz, &ierr);  // psi', -psi''/2
  if (ierr != 0) return false;
  *d = psi(1.0 + b) + a * (ans[0] / 2.0 - a * ans[1] / 3.0) - logGammaOnePlusOverA(a);
  return std::isfinite(*d);
}

// ln(1 + u/v) for u, v > 0 without forming an overflowing quotient.
double logOnePlusRatio(double u, double v) {
  return u <= v ? std::log1p(u / v) : std::log(u) - std::log(v) + std::log1p(v / u);
}

// ln I_x(s, t) at x <= 1/2 by the series, s <= kTinyShape; ln G(s, t) =
// D(s, t) - ln(1 + s/t). The terms proportional to s are summed before the
// multiplication by s, which may leave them below the normal range.
bool logLowerNearZero(double s, double t, double x, double lx, double* out) {
  double d = 0.0, sum = 0.0;
  if (!logGammaDefectOverA(s, t, &d) || !powerSeries(s, t, x, 2000, &sum)) return false;
  const double r = s / t;
  const double ratioTerm = r < 1e-8 ? (1.0 - 0.5 * r) / t : 0.0;
  *out = s * (lx + logOnePlusScaled(s, sum) + d - ratioTerm) -
         (r < 1e-8 ? 0.0 : logOnePlusRatio(s, t));
  return std::isfinite(*out);
}

// ln I_y(t, s) (the tail at the far end from the tiny shape s): ln G(t, s) =
// D(s, t) - ln(1 + t/s). Terms are positive; y up to 1 - 1e-3 takes up to
// 60/(1 - y) of them.
bool logLowerOfMirror(double s, double t, double y, double ly, double x, double* out) {
  double d = 0.0, sum = 0.0;
  const int terms = 200 + static_cast<int>(60.0 / std::fmax(x, 1e-3));
  if (!logGammaDefectOverA(s, t, &d) || !powerSeries(t, s, y, terms, &sum)) return false;
  *out = t * (ly + logOnePlusScaled(t, sum)) + s * d - logOnePlusRatio(t, s);
  return std::isfinite(*out);
}

// ln Gamma(a + b) - ln Gamma(b) for b > 1e-5, by Stirling's series with
// Loader's error term for large b, where the two terms would cancel.
double logGammaRatio(double a, double b) {
  if (b < 10.0) return std::lgamma(a + b) - std::lgamma(b);
  return (b - 0.5) * std::log1p(a / b) + a * std::log(a + b) - a + saddle::stirlerr(a + b) -
         saddle::stirlerr(b);
}

}  // namespace

bool gammaTails(double a, double z, double lz, double* lower, double* upper) {
  if (!(a > 0.0 && z >= 0.0 && std::isfinite(a) && std::isfinite(z) && std::isfinite(lz))) {
    return false;
  }
  if (a > 1.25) {
    // z^a / Gamma(1 + a) < 1.2e-350: nothing below z.
    if (!(z < kTinyArgument)) return false;
    *lower = 0.0;
    *upper = 1.0;
    return true;
  }
  if (!(a <= kTinyShape || z < kTinyArgument)) return false;
  if (z <= 1.0) {
    double sum = 0.0;
    if (!powerSeries(a, 0.0, -z, 200, &sum, true)) return false;
    fromLog(a * (lz + logOnePlusScaled(a, sum) - logGammaOnePlusOverA(a)), true, lower, upper);
    return true;
  }
  // Q(a, z) = a Gamma(a, z) / Gamma(1 + a), Gamma(a, z) = z^a e^-z times
  // Legendre's continued fraction 1/(z+1-a- 1(1-a)/(z+3-a- ...)) (A&S
  // 6.5.31), by the modified Lentz method; z > 1 makes it converge fast.
  const double tiny = 1e-300;
  double b = z + 1.0 - a, c = 1.0 / tiny, dd = 1.0 / b, f = dd;
  for (int i = 1; i < 500; ++i) {
    const double an = -i * (i - a);
    b += 2.0;
    dd = an * dd + b;
    if (std::fabs(dd) < tiny) dd = tiny;
    c = b + an / c;
    if (std::fabs(c) < tiny) c = tiny;
    dd = 1.0 / dd;
    const double delta = dd * c;
    f *= delta;
    if (std::fabs(delta - 1.0) <= 2.3e-16) {
      fromLog(std::log(a) + a * lz - z - gamln1(a) + std::log(f), false, lower, upper);
      return true;
    }
  }
  return false;
}

bool betaTails(double a, double b, double x, double lx, double y, double ly, double* lower,
               double* upper) {
  if (!(a > 0.0 && b > 0.0 && std::isfinite(a) && std::isfinite(b) && x >= 0.0 && y >= 0.0 &&
        std::isfinite(lx) && std::isfinite(ly))) {
    return false;
  }
  if (!(a <= kTinyShape || b <= kTinyShape)) return false;
  // Work with the tiny shape first: I_x(a, b) = 1 - I_y(b, a).
  if (b <= kTinyShape && (a > kTinyShape || b < a)) {
    std::swap(a, b);
    std::swap(x, y);
    std::swap(lx, ly);
    std::swap(lower, upper);
  }
  double logTail = 0.0;
  const bool nearZero = lx <= -0.6931471805599453;
  if (nearZero && (b <= 2.0 || b * x <= 0.1)) {
    if (!logLowerNearZero(a, b, x, lx, &logTail)) return false;
    fromLog(logTail, true, lower, upper);
    return true;
  }
  if (b >= 1e20) {
    // I_x(a, b) = P(a, b x) (1 + O((b x)^2 / b)): (1 - t)^(b - 1) is
    // e^-(b t) within b t^2, so the beta law scaled by b is the gamma law to
    // 3e-15 wherever b x < 745; beyond, both tails are 0 or 1 to double
    // precision either way.
    return gammaTails(a, b * x, std::log(b) + lx, lower, upper);
  }
  if (!nearZero || x >= 1e-3) {
    if (!logLowerOfMirror(a, b, y, ly, x, &logTail)) return false;
    fromLog(logTail, false, lower, upper);
    return true;
  }
  return false;
}

bool betaTailsAtTinyArgument(double a, double b, double x, double lx, double* lower,
                             double* upper) {
  if (!(a > kTinyShape && b > kTinyShape && std::isfinite(a) && std::isfinite(b) &&
        x < kTinyArgument && std::isfinite(lx))) {
    return false;
  }
  // The first omitted term is a (1 - b) x / (1 + a) against 1.
  if (b * x > 1e-17) return false;
  if (a > 1e6) {
    // x^a G(a, b) <= (x (a + b))^a / Gamma(1 + a), far below the normal range.
    *lower = 0.0;
    *upper = 1.0;
    return true;
  }
  const double lnGammaOnePlusA = a <= 1.25 ? gamln1(a) : std::lgamma(1.0 + a);
  fromLog(a * lx + logGammaRatio(a, b) - lnGammaOnePlusA, true, lower, upper);
  return true;
}

}  // namespace smallshape
}  // namespace qel
