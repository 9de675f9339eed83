// Shared arithmetic of the ELV routines: log(1+x) and exp(x)-1 for small x,
// logarithms of densities and masses that stay accurate near the mode for
// huge parameters, the gamma function and its scaled logarithm (Stirling's
// series with seven Bernoulli terms), and digamma with two derivatives.
//
// Refused arguments set the C errno to 33 (EDOM) or 34 (ERANGE) and answer a
// stated substitute; nothing here touches ELVerrno. Arguments of the library
// functions are guarded so that no call can raise a floating-point trap.
#include <qel/elv.h>

#include <cerrno>
#include <cmath>

#include "utilities/distributions/saddle_density.h"
#include "utilities/elv/limits.h"
#include "utilities/elv/precision.h"

namespace {

using qel::elv::kHuge;
using qel::elv::kOverflowLog;
using qel::elv::kUnderflowLog;

constexpr double kLnSqrt2Pi = 0.9189385332046727;
constexpr double kLn2 = 0.6931471805599453;
constexpr double kEulerGamma = 0.5772156649015329;
constexpr double kE = 2.718281828459045;
constexpr double kTwoPi = 6.283185307179586;

constexpr int kDomainError = 33;
constexpr int kRangeError = 34;

// Stirling correction ln Gamma(x) - ((x-1/2) ln x - x + ln sqrt(2 pi)), a
// polynomial in 1/x^2 with the Bernoulli coefficients B(2k)/(2k(2k-1)).
double stirlingCorrection(double x) {
  const double y = 1.0 / (x * x);
  const double poly =
      1.0 / 12 +
      y * (-1.0 / 360 +
           y * (1.0 / 1260 +
                y * (-1.0 / 1680 + y * (1.0 / 1188 + y * (-0.0019175269175269174 + y / 156)))));
  return poly / x;
}

// Moves x up by steps of 1 until it is at least 10; the product of the
// shifted values (x)(x+1)...(x+n-1) is returned in shiftProduct, so that
// Gamma(x) = Gamma(x+n)/shiftProduct.
double shiftToTen(double x, double* shiftProduct) {
  double product = 1.0;
  while (x < 10.0) {
    product *= x;
    x += 1.0;
  }
  *shiftProduct = product;
  return x;
}

// c ln(e/c), the cross term of a cell with count c and expectation e, where
// d = c - e; zero for an empty cell. The ratio enters through log(1+y) with y
// in (-1, 0], which keeps the term accurate when c and e are close.
double crossTerm(double c, double e, double d) {
  if (c == 0.0) return 0.0;
  // Far from the expectation the ratio e/c is itself accurate, while 1 + d/c
  // and 1 + d/e would cancel.
  if (e > 0.0 && (e < 0.5 * c || e > 2.0 * c)) return c * std::log(e / c);
  if (d >= 0.0) return c * logs(-d / c);
  return -c * logs(d / e);
}

}  // namespace

extern "C" {

double logs(double x) {
  if (x <= -1.0) {  // log(0) is refused as well: it would raise a trap
    errno = kDomainError;
    return -kHuge;
  }
  if (std::fabs(x) > 0.01) return std::log(1.0 + x);
  return x * (1.0 + x * (-1.0 / 2 +
                         x * (1.0 / 3 +
                              x * (-1.0 / 4 +
                                   x * (1.0 / 5 + x * (-1.0 / 6 +
                                                       x * (1.0 / 7 + x * (-1.0 / 8 + x / 9))))))));
}

double exps(double x) {
  if (x < kUnderflowLog || x > kOverflowLog) {
    errno = kDomainError;
    return -kHuge;
  }
  if (std::fabs(x) > 0.01) return std::exp(x) - 1.0;
  return x *
         (1.0 +
          x / 2 *
              (1.0 +
               x / 3 *
                   (1.0 +
                    x / 4 *
                        (1.0 +
                         x / 5 * (1.0 + x / 6 * (1.0 + x / 7 * (1.0 + x / 8 * (1.0 + x / 9))))))));
}

// x^(a-1) e^-x / Gamma(a) = exp(d + a u - ln_scaled_gamma(a) - u), d = a - x,
// u = ln(x/a).
void lnpgamma(double* out, double a, double x) {
  if (qel::elv::elvPrecision() == qel::elv::ElvPrecision::Full && a >= 1.0 && x > 0.5 * a &&
      x < 2.0 * a) {
    // Loader's saddle-point form (2000): the deviance a ln(a/x) + x - a and
    // Stirling's error term are each formed without cancellation, where
    // d + a u below cancels to the rounding of a near the mode.
    *out = -qel::saddle::bd0(a, x) - qel::saddle::stirlerr(a) - 0.918938533204672741780329736406 +
           0.5 * std::log(a) - std::log(x);
    return;
  }
  const double d = a - x;
  double u;
  if ((a < 1.0 && x > 1.0) || (a > 1.0 && x < 1.0)) {
    u = std::log(x) - std::log(a);
  } else if (x >= a) {
    u = logs(-d / a);
  } else {
    u = -logs(d / x);
  }
  *out = d + a * u - ln_scaled_gamma(a) - u;
}

void lnpbeta(double* out, double a, double b, double x) {
  const double s = a + b;
  const double e = x * s - a;
  double u;  // ln(x s / a)
  if (a <= 1.0) {
    u = std::log(s) + std::log(x) - std::log(a);
  } else if (e >= 0.0) {
    u = logs(e / a);
  } else {
    u = -logs(-e / (x * s));
  }
  double v;  // ln((1-x) s / b)
  if (b <= 1.0) {
    v = std::log(s) + std::log(1.0 - x) - std::log(b);
  } else if (e >= 0.0) {
    v = -logs(e / ((1.0 - x) * s));
  } else {
    v = logs(-e / b);
  }
  *out = ln_scaled_gamma(s) - ln_scaled_gamma(a) - ln_scaled_gamma(b) + (a - 1.0) * u +
         (b - 1.0) * v + std::log(s);
}

// ln(mean^k e^-mean / k!) with c = k + 1 and d = c - mean.
void lnppoisson(double k, double* out, double mean) {
  if (k == 0.0) {
    *out = -mean;
    return;
  }
  if (!(mean > 0.0)) {  // no mass above 0
    errno = kDomainError;
    *out = -kHuge;
    return;
  }
  const double c = k + 1.0;
  const double d = c - mean;
  double u;  // ln(mean / c)
  if (mean < 1.0) {
    u = std::log(mean) - std::log(c);
  } else if (d >= 0.0) {
    u = -logs(d / mean);
  } else {
    u = logs(-d / c);
  }
  *out = d + (c - 1.0) * u - ln_scaled_gamma(c);
}

void lnpbinomial(double k, double n, double* out, double prob) {
  const double d = k - n * prob;
  const double crossSuccess = crossTerm(k, n * prob, d);
  const double crossFailure = crossTerm(n - k, n * (1.0 - prob), -d);
  *out = ln_scaled_gamma(n) - ln_scaled_gamma(k) - ln_scaled_gamma(n - k) + crossSuccess +
         crossFailure;
}

// Hypergeometric mass of k in the table with margins M, N-M (rows) and n,
// N-n (columns); each cell deviates from its expectation by +-(k N - n M)/N.
void lnphyper(double k, double N, double M, double n, double* out) {
  const double d = (k * N - n * M) / N;
  const double cross = crossTerm(k, n * M / N, d) + crossTerm(n - k, n * (N - M) / N, -d) +
                       crossTerm(M - k, M * (N - n) / N, -d) +
                       crossTerm(N - M - n + k, (N - M) * (N - n) / N, d);
  const double margins =
      ln_scaled_gamma(M) + ln_scaled_gamma(N - M) + ln_scaled_gamma(n) + ln_scaled_gamma(N - n);
  const double cells = ln_scaled_gamma(k) + ln_scaled_gamma(n - k) + ln_scaled_gamma(M - k) +
                       ln_scaled_gamma(N - M - n + k);
  *out = margins - cells - ln_scaled_gamma(N) + cross;
}

double ln_gamma(double x) {
  if (!(x > 0.0)) {
    errno = kDomainError;
    return -kHuge;
  }
  double shiftProduct = 1.0;
  const double y = shiftToTen(x, &shiftProduct);
  return -std::log(shiftProduct) + (y - 0.5) * std::log(y) - y + kLnSqrt2Pi + stirlingCorrection(y);
}

double ln_scaled_gamma(double x) {
  if (x < 0.0) {
    errno = kDomainError;
    return kHuge;
  }
  if (x == 0.0) return 0.0;
  if (x <= 1e-5) return (0.42278433509846713 - std::log(x)) * x + 0.8224670334241132 * x * x;
  if (x > 9.0) return 0.5 * std::log(kTwoPi * x) + stirlingCorrection(x);
  return ln_gamma(1.0 + x) - x * (std::log(x) - 1.0);
}

double Gamma(double x) {
  if (!(x > 0.0)) {
    errno = kDomainError;
    return 0.0;
  }
  if (x < 2.220446049250313e-16) return 1.0 / x;
  double shiftProduct = 1.0;
  const double y = shiftToTen(x, &shiftProduct);
  const double correction = stirlingCorrection(y);
  const double logResult =
      -std::log(shiftProduct) + (y - 0.5) * std::log(y) - y + kLnSqrt2Pi + correction;
  if (logResult > kOverflowLog) {
    errno = kRangeError;
    return kHuge;
  }
  // (y/e)^y is formed as the square of (y/e)^(y/2): near the overflow limit
  // the power alone would exceed the largest double.
  const double halfPower = std::pow(y / kE, 0.5 * y);
  return halfPower * (halfPower * std::sqrt(kTwoPi / y) * std::exp(correction) / shiftProduct);
}

double gammod(double x) {
  if (!(x >= 0.0 && x <= 1.0)) {
    errno = kDomainError;
    return kHuge;
  }
  if (x > 0.0001) return (1.0 - Gamma(1.0 + x)) / x;
  return kEulerGamma - 0.5 * x * 1.978111990655945 - (x * x / 6.0) * (-5.4448744564853175);
}

}  // extern "C"

namespace {

// Bernoulli numbers B2 to B14, the coefficients of the asymptotic series of
// the digamma function and its derivatives.
constexpr double kBernoulli[7] = {1.0 / 6,  -1.0 / 30,     1.0 / 42, -1.0 / 30,
                                  5.0 / 66, -691.0 / 2730, 7.0 / 6};

// Poles at 0, -1, -2, ... and arguments so negative that the upward shift
// would take too long are refused.
bool digammaRefused(double x) {
  return (x <= 0.0 && x == std::floor(x)) || x < -1e7;
}

int stepsToTen(double x) {
  return static_cast<int>(std::ceil(10.0 - x));
}

}  // namespace

extern "C" {

double psi(double x) {
  if (digammaRefused(x)) {
    errno = kDomainError;
    return -kHuge;
  }
  if (x < 10.0) {
    const int n = stepsToTen(x);
    double value = psi(x + n);
    for (int i = 0; i < n; ++i) value -= 1.0 / (x + i);
    return value;
  }
  const double y = 1.0 / (x * x);
  double sum = 0.0, power = 1.0;
  for (int j = 1; j <= 7; ++j) {
    power *= y;
    sum += kBernoulli[j - 1] / (2 * j) * power;
  }
  return std::log(x) - 0.5 / x - sum;
}

double dpsi(double x) {
  if (digammaRefused(x)) {
    errno = kDomainError;
    return kHuge;
  }
  if (x < 10.0) {
    const int n = stepsToTen(x);
    double value = dpsi(x + n);
    for (int i = 0; i < n; ++i) value += 1.0 / ((x + i) * (x + i));
    return value;
  }
  const double y = 1.0 / (x * x);
  double sum = 0.0, power = 1.0 / x;
  for (int j = 1; j <= 7; ++j) {
    power *= y;
    sum += kBernoulli[j - 1] * power;
  }
  return 1.0 / x + 0.5 * y + sum;
}

double d2psi(double x) {
  if (digammaRefused(x)) {
    errno = kDomainError;
    return -kHuge;
  }
  if (x < 10.0) {
    const int n = stepsToTen(x);
    double value = d2psi(x + n);
    for (int i = 0; i < n; ++i) value -= 2.0 / ((x + i) * (x + i) * (x + i));
    return value;
  }
  const double y = 1.0 / (x * x);
  double sum = 0.0, power = y;
  for (int j = 1; j <= 7; ++j) {
    power *= y;
    sum += (2 * j + 1) * kBernoulli[j - 1] * power;
  }
  return -y - y / x - sum;
}

double phi(double x) {
  // Beyond 40 the density is below the smallest double; x*x could overflow.
  if (std::fabs(x) > 40.0) return 0.0;
  return 0.39894228040143265 * std::exp(-x * x / 2.0);
}

}  // extern "C"
