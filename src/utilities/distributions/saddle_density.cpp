// Saddle-point densities and masses after Loader (2000); see
// saddle_density.h.
#include "utilities/distributions/saddle_density.h"

#include <cfloat>
#include <cmath>
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
  if (std::fabs(x - m) < 0.5 * (x + m)) {
    // With v = (x - m)/(x + m) the deviance is (x - m) v + 2 x sum v^(2j+1)/(2j+1).
    double v = (x - m) / (x + m);
    double s = (x - m) * v;
    double term = 2.0 * x * v;
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
  if (lr > 0.0 && x > DBL_MAX / lr) return HUGE_VAL;
  return x * lr + m - x;
}

double poissonMass(double x, double m) {
  if (m == 0.0) return x == 0.0 ? 1.0 : 0.0;
  if (x < 0.0) return 0.0;
  if (x == 0.0) return checkedExp(-m);
  return checkedExp(-stirlerr(x) - bd0(x, m)) / std::sqrt(k2Pi * x);
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

// x^(a-1) e^-x / Gamma(a): a Poisson mass of mean x at a - 1.
double gammaDensity(double x, double shape) {
  if (!(x > 0.0)) return 0.0;
  if (shape < 1.0) return poissonMass(shape, x) * shape / x;
  return poissonMass(shape - 1.0, x);
}

// x^(a-1) (1-x)^(b-1) / B(a, b) = (a + b - 1) times a binomial mass of
// a - 1 in a + b - 2 trials, for shapes of at least 1.
double betaDensity(double x, double a, double b) {
  if (!(x > 0.0 && x < 1.0)) return 0.0;
  if (a >= 1.0 && b >= 1.0) return (a + b - 1.0) * binomialMass(a - 1.0, a + b - 2.0, x, 1.0 - x);
  // A shape below 1: the mass of a in a + b trials is x^a (1-x)^b
  // Gamma(a+b+1)/(Gamma(a+1) Gamma(b+1)), and 1/B(a,b) is that constant
  // times a b/(a + b).
  return a * b / ((a + b) * x * (1.0 - x)) * binomialMass(a, a + b, x, 1.0 - x);
}

// F density with m, n degrees of freedom through the binomial form with
// p = m x/(n + m x), q = n/(n + m x).
double fDensity(double x, double m, double n) {
  if (!(x > 0.0)) return 0.0;
  const double s = n + m * x;
  const double p = m * x / s, q = n / s;
  if (m >= 2.0) return m * q / 2.0 * binomialMass((m - 2.0) / 2.0, (m + n - 2.0) / 2.0, p, q);
  return m * m * q / (2.0 * p * (m + n)) * binomialMass(m / 2.0, (m + n) / 2.0, p, q);
}

// Gamma(u) / (Gamma(v) sqrt(n pi)) (1 + x^2/n)^-u with u = (n+1)/2,
// v = n/2. Stirling's formula for both gamma functions gives
// Gamma(u)/Gamma(v) = sqrt(v) exp(stirlerr(u) - stirlerr(v) - bd0(v, u)),
// the deviance bd0(v, u) = v ln(v/u) + u - v collecting the powers.
double tDensity(double x, double n) {
  const double u = (n + 1.0) / 2.0, v = n / 2.0;
  const double r = std::fabs(x) / std::sqrt(n);
  // ln(1 + r^2), without forming r^2 where it would overflow.
  const double lg = r > 1e100 ? 2.0 * checkedLog(r) : std::log1p(r * r);
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
