// Large-parameter helpers (see large_parameters.h).
#include "utilities/distributions/large_parameters.h"

#include <cfloat>
#include <cmath>
#include <functional>

#include "utilities/distributions/beta_ratio.h"
#include "utilities/distributions/gamma_ratio.h"
#include "utilities/distributions/saddle_density.h"
#include "utilities/elv/normal_precise.h"

namespace qel {
namespace large {

double gammaQuantileStart(double p, double shape) {
  if (!(p > 0.0 && p < 1.0) || !(shape > 0.0) || std::isinf(shape)) return NAN;
  const double z = elv::normalQuantile(p);
  const double c = (1.0 / 9.0) / shape;  // may be subnormal for a near DBL_MAX: read as 0
  const double t = 1.0 - c + z * std::sqrt(c);
  if (!(t > 0.0)) return NAN;  // z far below -3 sqrt(a): no cube-root start
  const double t3 = t * t * t;
  if (t3 > 1.0 && shape > DBL_MAX / t3) return NAN;
  return shape * t3;
}

double logStep(double shape) {
  // A step below a few units in the last place of ln x would leave x as it is.
  return std::fmax(0.5 / std::sqrt(shape), 8.0 * DBL_EPSILON * std::fmax(1.0, std::log(shape)));
}

namespace {

constexpr double kMaxTerms = 1e5;
constexpr double kWeightWidth = 12.0;  // Poisson weights within 12 sd: the rest below e^-72

// One family of the mixture: the tails L_j (lower, decreasing in j) and
// U_j = 1 - L_j at index j, the mass m_j with L_{j+1} = L_j - m_j, and the
// ratio m_{j+1} / m_j.
struct Chain {
  std::function<bool(double j, double* lower, double* upper)> tails;
  std::function<double(double j)> mass;
  std::function<double(double j)> ratio;
};

// sum_j w_j L_j (lowerSide) or sum_j w_j U_j over the Poisson(half) weights
// on [j0, j1]. U_j is summed from j0 up (U_{j+1} = U_j + m_j), L_j from j1
// down (L_{j-1} = L_j + m_{j-1}), so every step adds a positive term; where
// the shape at j1 is not a double (a + j1 rounds, a beyond 2^52), L_j comes
// from j = 0 up (L_{j+1} = L_j - m_j), whose terms are then a part in
// sqrt(a) of L_j, and the tails are only formed at the exact shape.
bool smallerTail(const Chain& c, double a, double half, double j0, double j1, bool lowerSide,
                 double* tail) {
  const bool exactShapes = (a + j1) - a == j1;
  const bool down = lowerSide && exactShapes;
  double first = down ? j1 : exactShapes ? j0 : 0.0;
  double lower = 0.0, upper = 0.0;
  if (!c.tails(first, &lower, &upper)) return false;
  double g = lowerSide ? lower : upper;
  double m = c.mass(first);
  for (; first < j0; first += 1.0) {  // from the exact shape to the window
    g += lowerSide ? -m : m;
    m *= c.ratio(first);
  }
  double w = saddle::poissonMass(first, half);
  double sum = 0.0;
  for (double j = first;; j += down ? -1.0 : 1.0) {
    sum += w * g;
    if (down ? j <= j0 : j >= j1) break;
    if (down) {
      m /= c.ratio(j - 1.0);
      g += m;
      w *= j / half;
    } else {
      g += lowerSide ? -m : m;
      m *= c.ratio(j);
      w *= half / (j + 1.0);
    }
  }
  *tail = sum;
  return std::isfinite(sum) && sum >= 0.0;
}

// The mixture over Poisson(half) weights, the smaller tail by the chain and
// the other as its complement; lowerSide says which is the smaller.
bool mixture(const Chain& c, double a, double half, bool lowerSide, double* lower, double* upper) {
  const double spread = kWeightWidth * std::sqrt(half) + 10.0;
  const double j0 = std::fmax(0.0, std::floor(half - spread)), j1 = std::ceil(half + spread);
  if (j1 - j0 > kMaxTerms) return false;
  double tail = 0.0;
  if (!smallerTail(c, a, half, j0, j1, lowerSide, &tail)) return false;
  *lower = lowerSide ? tail : 0.5 + (0.5 - tail);
  *upper = lowerSide ? 0.5 + (0.5 - tail) : tail;
  return true;
}

}  // namespace

bool noncentralChiSqTails(double x, double df, double ncp, double* lower, double* upper) {
  if (!(x > 0.0) || !(df > 0.0) || !(ncp > 0.0) || std::isinf(x) || std::isinf(df)) return false;
  const double a = 0.5 * df, y = 0.5 * x, half = 0.5 * ncp;
  // P(a+j+1, y) = P(a+j, y) - y^(a+j) e^-y / Gamma(a+j+1) (A&S 6.5.21).
  const Chain c{
      [a, y](double j, double* l, double* u) { return gammaratio::tails(a + j, y, l, u); },
      [a, y](double j) { return saddle::poissonMass(a + j, y); },
      [a, y](double j) { return y / (a + j + 1.0); }};
  return mixture(c, a, half, y < a + half, lower, upper);
}

bool noncentralFTails(double x, double df1, double df2, double ncp, double* lower, double* upper) {
  if (!(x > 0.0) || !(df1 > 0.0) || !(df2 > 0.0) || !(ncp > 0.0) || std::isinf(x) ||
      !(df1 + df2 + ncp < 1e306)) {
    return false;
  }
  if (!(x <= 0.25 * DBL_MAX / df1 && df2 <= 0.25 * DBL_MAX)) return false;  // no overflow trap
  const double a = 0.5 * df1, b = 0.5 * df2, half = 0.5 * ncp;
  const double sum = df1 * x + df2;
  const double y = df1 * x / sum, z = df2 / sum;  // y and 1 - y
  // I_y(a+j+1, b) = I_y(a+j, b) - y^(a+j) (1-y)^b / ((a+j) B(a+j, b)) (DLMF
  // 8.17.20); the mass is y (1-y) / (a+j) times the beta density.
  const Chain c{
      [a, b, y, z](double j, double* l, double* u) {
        return betaratio::anyTails(a + j, b, y, z, l, u);
      },
      [a, b, y, z](double j) { return saddle::betaDensity(y, a + j, b) * y * z / (a + j); },
      [a, b, y](double j) { return y * (a + b + j) / (a + j + 1.0); }};
  // The mean of the mixture's beta variable sits near (a + half)/(a + half + b).
  return mixture(c, a, half, y < (a + half) / (a + half + b), lower, upper);
}

bool noncentralTTails(double x, double df, double delta, double* lower, double* upper) {
  if (!(df > 0.0) || !std::isfinite(df) || !std::isfinite(x) || !std::isfinite(delta)) return false;
  const double z = x - delta;
  const double ax = 1.0 + std::fabs(x), az = 1.0 + std::fabs(z);
  const double size = ax * ax * az * az;  // (1 + |x|)^2 (1 + |z|)^2, at most ~1e6 here
  if (!(std::fabs(z) < 38.0)) {
    // Both tails beyond 1e-300 from the normal limit: W within 1e-5 of 1.
    if (!(std::fabs(x) < 1e5 && df > 1e12)) return false;
    *lower = z < 0.0 ? 0.0 : 1.0;
    *upper = z < 0.0 ? 1.0 : 0.0;
    return true;
  }
  if (!(size < 1e-8 * df)) return false;
  const double density = std::exp(-0.5 * z * z) * 0.3989422804014327;  // phi(z)
  const double correction = density * (x + x * x * z) / (4.0 * df);
  // The smaller tail directly: Phi(-|z|) from the normal upper tail.
  const double far = elv::normalUpperTail(std::fabs(z));
  if (z < 0.0) {
    *lower = far - correction;
    *upper = 0.5 + (0.5 - *lower);
  } else {
    *upper = far + correction;
    *lower = 0.5 + (0.5 - *upper);
  }
  return *lower >= 0.0 && *upper >= 0.0;
}

namespace {

// 1 when k reaches p, 0 when not, -1 when the tails fail.
int reaches(const TailPair& tails, double p, double k) {
  double lower = 0.0, above = 0.0;
  if (!tails(k, &lower, &above) || std::isnan(lower) || std::isnan(above)) return -1;
  return (p <= 0.5 ? lower >= p : above <= 1.0 - p) ? 1 : 0;
}

// The whole number between a and b (a < b), or a or b when there is none.
double midpoint(double a, double b) {
  return std::floor(a + 0.5 * (b - a));
}

}  // namespace

double discreteQuantile(const TailPair& tails, double p, double lo, double start, double spread) {
  if (!(p > 0.0 && p < 1.0) || !(start >= lo) || !std::isfinite(start)) return NAN;
  double below = lo - 1.0, high = start;  // below never reaches p, high does
  double step = std::fmax(spread, 1.0);
  int r = reaches(tails, p, start);
  if (r < 0) return NAN;
  if (r == 1) {
    while (high > lo) {
      const double k = std::fmax(high - step, lo);
      if (k == high) break;
      r = reaches(tails, p, k);
      if (r < 0) return NAN;
      if (r == 0) {
        below = k;
        break;
      }
      high = k;
      step += step;
    }
  } else {
    below = start;
    for (;;) {
      if (step > DBL_MAX - high) return NAN;
      const double k = high + step;
      r = reaches(tails, p, k);
      if (r < 0) return NAN;
      if (r == 1) {
        high = k;
        break;
      }
      below = k;
      high = k;
      step += step;
    }
  }
  for (;;) {
    const double mid = midpoint(below, high);
    if (!(mid > below && mid < high)) return high;  // neighbouring whole doubles
    r = reaches(tails, p, mid);
    if (r < 0) return NAN;
    (r == 1 ? high : below) = mid;
  }
}

double cornishFisherStart(double p, double mean, double sd, double skew, double lo) {
  const double z = elv::normalQuantile(p);
  const double k = std::floor(mean + sd * (z + (z * z - 1.0) * skew / 6.0));
  return std::isfinite(k) ? std::fmax(k, lo) : mean;
}

}  // namespace large
}  // namespace qel
