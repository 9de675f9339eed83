// Beta distribution: both tails of I_x(a,b), each to full relative accuracy,
// and the density.
//
// The smaller tail is computed directly as the density times a scaled series
// whose leading term is 1. For the lower tail the recurrence
//   I_x(a,b) = I_x(a+1,b-1) + x^a (1-x)^(b-1) / (a B(a,b))
// gives the finite form with term ratio ((b-j)/(a+j)) x/(1-x), and the
// hypergeometric form I_x(a,b) = x^a (1-x)^b / (a B(a,b)) 2F1(a+b,1;a+1;x)
// the second form with ratio (a+b+j-1) x/(a+j) (Abramowitz & Stegun 26.5.23).
// The upper tail mirrors the finite form; when it does not terminate, it is
// finished from a shape below 1 by Gauss's continued fraction for
// 2F1(1-a,1;b+1;-(1-x)/x), or for small b x by a power series of the
// complementary integral. Every small quantity is carried as a logarithm and
// compared with the underflow limit: a tail too small for a double is an
// exact 0 with code 1.
#include <qel/elv.h>

#include <cmath>
#include <utility>

#include "utilities/elv/limits.h"
#include "utilities/elv/precision.h"

namespace {

using namespace qel::elv;

constexpr long kBetaSeriesCap = 1000000;
// Enough for a gap of 2e-15 at the slowest admissible convergence.
constexpr int kContinuedFractionSteps = 400;
constexpr int kPowerSeriesTerms = 30;
constexpr double kEulerGamma = 0.5772156649015329;
constexpr double kZeta2 = 1.6449340668482264;
constexpr double kPsi2At1 = -2.4041138063191885;  // psi''(1) = -2 zeta(3)
constexpr double kLn2 = 0.6931471805599453;
// Above this both shapes count as vanishing: all mass sits at 0 and 1.
constexpr double kTinyShape = 1.50978783374313e-12;

// Logarithm of a quantity that rounding may have left at or below 0.
double logOrLow(double v) {
  return v > 0.0 ? std::log(v) : -kHuge;
}

int seriesFailed(const char* name) {
  ELVexit(name, 4, 'F');
  return 4;
}

// Horner pass for sum_j prod_{i<=j} ratio(i), from the top value down.
template <class Ratio>
double hornerSum(long n, double top, Ratio ratio) {
  double sum = top;
  for (long j = n; j >= 1; --j) sum = 1.0 + ratio(j) * sum;
  return sum;
}

// Median-like border between the tails (x <= 0.5 after the exchange).
double tailBorder(double a, double b) {
  if (b >= 1.0 && a >= 0.6) {
    const double s = a + b;
    return a / s - (b - a) / (3.0 * s * s);
  }
  // For small a the lower tail near 0 is x^a / (a B(a,b)): the border is the
  // point where that reaches 1/2.
  double v = ln_gamma(1.0 + a) - kLn2;
  if (b <= 100.0) {
    v += ln_gamma(b) - ln_gamma(a + b);
  } else {
    v -= a * std::log(b);
  }
  if (v >= a * -kLn2) return 0.5;
  if (v < underflowLog() * a) return 0.0;
  return std::exp(v / a);
}

}  // namespace

extern "C" {

// I_x(a,b) = density(a,b,x) * out.
int beta_Iabx(double* out, double a, double b, double x) {
  static const char* const name = "beta_Iabx";
  const double y = x / (1.0 - x);
  // Finite form: terminates for integer b, converges while its alternating
  // tail shrinks at least as fast as x/(1-x) < 1/2.
  double term = 1.0;
  long n = 0;
  bool finite = false;
  for (;;) {
    ++n;
    if (n >= kBetaSeriesCap) return seriesFailed(name);
    const double ratio = (b - n) / (a + n) * y;
    if (ratio < -0.5) break;
    term *= ratio;
    if (std::fabs(term) < seriesCutoff()) {
      finite = true;
      break;
    }
  }
  if (finite) {
    // Past b the remaining terms alternate with ratio near -x/(1-x): their
    // sum is about the last term times (1-x).
    const double top = (b - 1.0 >= n) ? 1.0 : 1.0 - x;
    *out = hornerSum(n, top, [=](long j) { return (b - j) / (a + j) * y; }) * x / a;
    ELVsteps1 = n;
    ELVexit(name, 0, 'N');
    return 0;
  }
  // Hypergeometric form: positive terms, geometric tail with ratio x.
  term = 1.0;
  n = 0;
  while (term >= seriesCutoff()) {
    ++n;
    if (n >= kBetaSeriesCap) return seriesFailed(name);
    term *= (a + b + n - 1.0) * x / (a + n);
  }
  *out = hornerSum(n, 1.0 / (1.0 - x), [=](long j) { return (a + b + j - 1.0) * x / (a + j); }) *
         x * (1.0 - x) / a;
  ELVsteps2 = n;
  ELVexit(name, 0, 'N');
  return 0;
}

// 1 - I_x(a,b) = density(a,b,x) ((1-x)/b) * out.
int beta_Jabx(double* out, double a, double b, double x) {
  static const char* const name = "beta_Jabx";
  const double u = (1.0 - x) / x;
  double term = 1.0;
  long n = 0;
  bool finite = false;
  for (;;) {
    if (n + 1 > a) break;  // the terms would change sign: not finite
    ++n;
    if (n >= kBetaSeriesCap) return seriesFailed(name);
    term *= (a - n) / (b + n) * u;
    if (term < seriesCutoff()) {
      finite = true;
      break;
    }
  }
  double top = 1.0;
  if (finite) {
    ELVmethod = 0;
  } else {
    n = static_cast<long>(std::floor(a));
    if (beta_J_complete(&top, a - n, b + n, x) != 0) return seriesFailed(name);
  }
  *out = hornerSum(n, top, [=](long j) { return (a - j) / (b + j) * u; });
  ELVsteps1 = n;
  ELVexit(name, 0, 'N');
  return 0;
}

// The factor of beta_Jabx for 0 <= a < 1, where the finite form has no end.
int beta_J_complete(double* out, double a, double b, double x) {
  if (b * x < 1.0) {
    // (1 - I_x(a,b)) b^a B(a,b) by the power series of beta_ps.
    const double lnScale =
        (a - 1.0) * (std::log(b) + std::log(x)) + b * std::log1p(-x);  // b^(a-1) x^(a-1) (1-x)^b
    *out = beta_ps(x, a, b) * std::exp(-lnScale);
    ELVsteps2 = 12;
    ELVmethod = 2;
    return 0;
  }
  // Gauss's continued fraction: with u = (1-x)/x,
  //   2F1(1-a,1;b+1;-u) = 1/(1+ d1 u/(1+ d2 u/(1+ ...))),
  //   d(2m+1) = (1-a+m)(b+m)/((b+2m)(b+2m+1)), d(2m) = m(b+a-1+m)/((b+2m-1)(b+2m)).
  // The partial numerators are positive, so odd and even convergents
  // bracket the value.
  const double u = (1.0 - x) / x;
  const double c = 1.0 - a;
  // Convergents A/B of 0 + 1/(1 + d1 u/(1 + ...)): (A, B) and the previous pair.
  double Aprev = 0.0, Bprev = 1.0;  // convergent 0
  double A = 1.0, B = 1.0;          // convergent 1
  int k = 1;
  for (int step = 1; step <= kContinuedFractionSteps; ++step) {
    double pair[2];
    for (int half = 0; half < 2; ++half, ++k) {
      double d;
      const int m = k / 2;
      if (k % 2 == 1) {
        d = (c + m) * (b + m) / ((b + 2.0 * m) * (b + 2.0 * m + 1.0));
      } else {
        d = m * (b - c + m) / ((b + 2.0 * m - 1.0) * (b + 2.0 * m));
      }
      const double An = A + d * u * Aprev;
      const double Bn = B + d * u * Bprev;
      Aprev = A;
      Bprev = B;
      A = An;
      B = Bn;
      if (B > 1e250) {  // rescale: only the ratios matter
        A *= 1e-250;
        B *= 1e-250;
        Aprev *= 1e-250;
        Bprev *= 1e-250;
      }
      pair[half] = A / B;
    }
    if (std::fabs(pair[1] - pair[0]) < fractionGap() * pair[1]) {
      *out = 0.5 * (pair[0] + pair[1]);
      ELVmethod = 1;
      ELVsteps2 = step;
      return 0;
    }
  }
  ELVsteps2 = kContinuedFractionSteps;
  return 4;
}

// b^a (B(a,b) - B_x(a,b)) for a < 1 and b x < 1, from
//   b^a B_x(a,b) = (b x)^a sum_i C(b-1,i) (-x)^i / (a+i)
// and Gamma(a) = 1/a - gammod(a), so that (1 - (bx)^a)/a is formed by exps.
double beta_ps(double x, double a, double b) {
  const double c = gammod(a);
  double first;
  if (a >= 1e-5 && b < 50.0) {
    first = Gamma(a) * (std::pow(b, a) * Gamma(b) / Gamma(a + b) - 1.0);
  } else {
    first = Gamma(a) * exps(beta_lntab(a, b));
  }
  const double lnbx = std::log(b) + std::log(x);
  const double t = (kTinyArgument / a > std::fabs(lnbx)) ? -lnbx : -exps(a * lnbx) / a;
  double term = std::exp(a * lnbx) * (b - 1.0) * x / (1.0 + a);
  double s = term;
  int i = 2;
  for (; i <= kPowerSeriesTerms && std::fabs(term) > seriesCutoff(); ++i) {
    term *= -((b - i) / i) * ((a + i - 1.0) / (a + i)) * x;
    s += term;
  }
  ELVsteps2 = i - 1;
  return first - c + t + s;
}

// ln(b^a Gamma(b) / Gamma(a+b)).
double beta_lntab(double a, double b) {
  if (a >= 1e-5 && b < 50.0) return a * std::log(b) + ln_gamma(b) - ln_gamma(a + b);
  if (b >= 50.0) {
    const double ab = (1.0 - a) * a;
    return ab / (2.0 * b) *
           (1.0 +
            (1.0 / (6.0 * b)) * (1.0 - 2.0 * a - ab / b -
                                 (1.0 - 2.0 * a) * (1.0 + 3.0 * a - 3.0 * a * a) / (10.0 * b * b)));
  }
  if (b >= 0.006) {
    // Taylor series in a around 0.
    return (std::log(b) - psi(b)) * a - 0.5 * a * a * dpsi(b) - a * a * a * d2psi(b) / 6.0;
  }
  // Both small: ln Gamma(z) = -ln z - gamma z + zeta(2) z^2/2 - zeta(3) z^3/3.
  return (a - 1.0) * std::log(b) + std::log(a + b) + kEulerGamma * a -
         (2.0 * b + a) * a / 2.0 * kZeta2 -
         a * (a * a + 3.0 * a * b + 3.0 * b * b) / 6.0 * kPsi2At1;
}

void beta_df(double x, double a, double b, double* lower, double* upper, double* density) {
  static const char* const name = "beta_df";
  ELVstartup(name);
  ELVmethod = 0;
  ELVsteps1 = 0;
  ELVsteps2 = 0;
  if (anyNan(x, a, b) || x < 0.0 || x > 1.0 || a < 0.0 || b < 0.0 || a > kMaxShape ||
      b > kMaxShape) {
    ELVexit(name, 2, 'F');
    return;
  }
  if (x < kTinyArgument || x == 1.0) {
    *lower = x < kTinyArgument ? 0.0 : 1.0;
    *upper = 1.0 - *lower;
    *density = -1.0;
    ELVexit(name, 0, 'F');
    return;
  }
  if ((a > b ? a : b) < kTinyShape || a == 0.0 || b == 0.0) {
    // The law tends to two point masses, at 0 with weight b/(a+b) and at 1.
    const double s = a + b;
    *lower = s > 0.0 ? b / s : 0.5;
    *upper = s > 0.0 ? a / s : 0.5;
    *density = -1.0;
    ELVexit(name, (a == 0.0) != (b == 0.0) ? 0 : 1, 'F');
    return;
  }
  const bool exchanged = x > 0.5;
  if (exchanged) {
    std::swap(a, b);
    x = 1.0 - x;
  }
  double lp;
  lnpbeta(&lp, a, b, x);
  *density = expOrZero(lp);

  int code = 0;
  double lo = 0.0, up = 0.0;
  if (x > tailBorder(a, b)) {
    if (a < 1.0 && b * x < 1.0) {
      const double S = beta_ps(x, a, b);
      const double d = beta_lntab(a, b);
      up = (logOrLow(S) - ln_gamma(a) - d >= underflowLog()) ? S / Gamma(a) / std::exp(d) : 0.0;
      ELVmethod += 50;
    } else {
      const double L = lp + std::log1p(-x) - std::log(b);
      const double r = ((a - 1.0) / (1.0 + b)) * (1.0 - x) / x;
      double J;
      if (L >= underflowLog()) {
        if (beta_Jabx(&J, a, b, x) != 0) goto seriesFailure;
        up = std::exp(L) * J;
        ELVmethod += 60;
      } else if (a <= 1.0 || (r < 1.0 && L - std::log1p(-r) < underflowLog())) {
        code = 1;
        ELVmethod = 70;
      } else {
        if (beta_Jabx(&J, a, b, x) != 0) goto seriesFailure;
        const double logUpper = logOrLow(J) + L;
        if (logUpper < underflowLog()) {
          code = 1;
          ELVmethod += 80;
        } else {
          up = std::exp(logUpper);
          ELVmethod += 90;
        }
      }
    }
    lo = 1.0 - up;
  } else {
    const double r = ((b - 1.0) / (1.0 + a)) * x / (1.0 - x);
    double I;
    if (lp >= underflowLog()) {
      if (beta_Iabx(&I, a, b, x) != 0) goto seriesFailure;
      if (logOrLow(I) + lp < underflowLog()) {
        code = 1;
        ELVmethod = 15;
      } else {
        lo = *density * I;
        ELVmethod = 10;
      }
    } else if (b <= 1.0 || (r < 1.0 && lp - std::log1p(-r) < underflowLog())) {
      code = 1;
      ELVmethod = 20;
    } else {
      if (beta_Iabx(&I, a, b, x) != 0) goto seriesFailure;
      const double logLower = logOrLow(I) + lp;
      if (logLower < underflowLog()) {
        code = 1;
        ELVmethod = 30;
      } else {
        lo = std::exp(logLower);
        ELVmethod = 40;
      }
    }
    up = 1.0 - lo;
  }
  *lower = exchanged ? up : lo;
  *upper = exchanged ? lo : up;
  ELVexit(name, code, 'F');
  return;

seriesFailure:
  ELVexit(name, 4, 'N');
}

}  // extern "C"
