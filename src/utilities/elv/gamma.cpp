// Gamma distribution with shape a and unit scale: both tails, each to full
// relative accuracy, and the density.
//
// The smaller tail is computed directly as the density times a scaled series
// whose terms start at 1: for the lower tail
//   P(a,x) = (x/a) p(a,x) [1 + x/(a+1) + x^2/((a+1)(a+2)) + ...],
// for the upper tail
//   Q(a,x) = p(a,x) [1 + (a-1)/x + (a-1)(a-2)/x^2 + ...],
// the latter finished for a non-integer shape by Legendre's continued
// fraction for the incomplete gamma function (Abramowitz & Stegun 6.5.31),
// or by a power series of Gamma(a, x) for small a and x. Every small quantity
// is carried as a logarithm and compared with the underflow limit, so a tail
// down to 1e-290 keeps its relative accuracy and a smaller one is reported as
// an exact 0 with code 1. The other tail is 1 minus the direct one.
#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

constexpr long kIaxCap = 1000001;
constexpr long kJaxCap = 1000000;
// Enough for a gap of 2e-15 at the slowest admissible convergence.
constexpr int kContinuedFractionSteps = 400;
constexpr int kPowerSeriesTerms = 40;

}  // namespace

extern "C" {

// Lower-tail factor 1 + x/(a+1) + x^2/((a+1)(a+2)) + ...: a forward pass
// fixes the number of terms, a backward Horner pass sums them smallest first.
int gamma_Iax(double* out, double a, double x) {
  double term = 1.0;
  long n = 0;
  while (term >= seriesCutoff()) {
    ++n;
    if (n >= kIaxCap) {
      ELVsteps1 = 0;
      ELVexit("gamma_Iax", 4, 'F');
      return 4;
    }
    term *= x / (a + n);
  }
  double sum = 1.0;
  for (long j = n; j >= 1; --j) sum = 1.0 + sum * x / (a + j);
  *out = sum;
  ELVsteps1 = n;
  ELVexit("gamma_Iax", 0, 'N');
  return 0;
}

// Upper-tail factor J(a,x) = Gamma(a,x) e^x x^(1-a) by the recurrence
// J(a) = 1 + ((a-1)/x) J(a-1). If the terms die out before the shape is used
// up, the finite sum is the result (ELVmethod 0); otherwise the recurrence is
// started from J at the fractional part of a.
int gamma_Jax(double* out, double a, double x) {
  double term = 1.0;
  long n = 0;
  while (n + 1 <= a - 1.0 && term >= seriesCutoff()) {
    ++n;
    if (n >= kJaxCap) {
      ELVsteps1 = 0;
      ELVexit("gamma_Jax", 4, 'F');
      return 4;
    }
    term *= (a - n) / x;
  }
  double sum = 1.0;
  if (term < seriesCutoff()) {
    ELVmethod = 0;
  } else {
    n = static_cast<long>(std::floor(a));
    if (gamma_J_complete(&sum, x, a - n) != 0) {
      ELVexit("gamma_Jax", 4, 'F');
      return 4;
    }
  }
  for (long j = n; j >= 1; --j) sum = sum * (a - j) / x + 1.0;
  *out = sum;
  ELVsteps1 = n;
  ELVexit("gamma_Jax", 0, 'N');
  return 0;
}

// J(a,x) for 0 <= a < 1. Small x: from the power series of Gamma(a,x).
// Otherwise Legendre's continued fraction, whose odd and even convergents
// A1/B1 and A2/B2 bracket the value and approach it from below.
int gamma_J_complete(double* out, double x, double a) {
  if (a >= 0.0 && x < 1.0) {
    *out = std::exp(x) * std::pow(x, 1.0 - a) * gamma_ps(x, a);
    ELVmethod = 2;
    return 0;
  }
  double A1 = 0.0, A2 = 1.0, B1 = 1.0, B2 = 1.0;
  for (int n = 1; n <= kContinuedFractionSteps; ++n) {
    A1 = (n - a) * A1 + x * A2;
    B1 = x * B2 + (n - a) * B1;
    A2 = n * A2 + A1;
    B2 = n * B2 + B1;
    // The convergents grow like n! x^n; rescaling keeps them finite without
    // changing their ratios.
    if (B2 > 1e100) {
      A1 *= 1e-100;
      B1 *= 1e-100;
      A2 *= 1e-100;
      B2 *= 1e-100;
    }
    const double odd = A1 / B1, even = A2 / B2;
    if ((even - odd) / odd < fractionGap()) {
      *out = 0.5 * (odd + even);
      ELVmethod = 1;
      ELVsteps2 = n;
      return 0;
    }
  }
  ELVsteps2 = kContinuedFractionSteps;
  return 4;
}

// Gamma(a,x) for a < 1, x < 1: Gamma(a) - gamma(a,x) with
// Gamma(a) = 1/a - gammod(a) and gamma(a,x) = sum (-1)^i x^(a+i)/(i!(a+i)),
// where (1 - x^a)/a is formed from exps(a ln x) to avoid cancellation.
double gamma_ps(double x, double a) {
  const double c = gammod(a);
  const double lnx = std::log(x);
  // For a so small that a ln x vanishes, (1 - x^a)/a is -ln x.
  const double t = (kTinyArgument > std::fabs(lnx) * a) ? -lnx : -exps(a * lnx) / a;
  double term = std::pow(x, 1.0 + a) / (1.0 + a);
  double s = term;
  int i = 2;
  for (; i <= kPowerSeriesTerms && std::fabs(term) > seriesCutoff(); ++i) {
    term *= (-x / i) * ((a + i - 1.0) / (a + i));
    s += term;
  }
  ELVsteps2 = i - 1;
  return t - c + s;
}

void gamma_df(double x, double a, double* lower, double* upper, double* density) {
  static const char* const name = "gamma_df";
  ELVstartup(name);
  ELVsteps1 = 0;
  ELVsteps2 = 0;
  if (anyNan(x, a) || a <= 0.0 || x < 0.0 || a > kMaxShape) {
    ELVmethod = 0;
    ELVexit(name, 2, 'F');
    return;
  }
  if (x < kTinyArgument) {
    *lower = 0.0;
    *upper = 1.0;
    ELVmethod = 1;
    ELVexit(name, 0, 'F');
    return;
  }
  if (x > kMaxDf) {
    *lower = 1.0;
    *upper = 0.0;
    *density = 0.0;
    ELVmethod = 2;
    ELVexit(name, 0, 'F');
    return;
  }
  ELVmethod = 0;
  double lp;
  lnpgamma(&lp, a, x);
  *density = expOrZero(lp);

  // Border between the tails: near the median, which lies close to a - 1/3;
  // for small a, where the median is 2^(-1/a) Gamma(1+a)^(1/a) approximately.
  double border;
  if (a >= 0.59) {
    border = a - 0.3333333333333333;
  } else {
    const double v = (ln_gamma(1.0 + a) - 0.6931471805599453) / a;
    border = expOrZero(v);
  }

  int code = 0;
  if (x > border) {
    if (a < 1.0 && x < 1.0) {
      const double S = gamma_ps(x, a);
      *upper = (std::log(S) - ln_gamma(a) >= underflowLog()) ? S / Gamma(a) : 0.0;
      *lower = 1.0 - *upper;
      ELVmethod = 50;
    } else if (lp >= underflowLog()) {
      double J;
      if (gamma_Jax(&J, a, x) != 0) goto seriesFailure;
      *upper = *density * J;
      *lower = 1.0 - *upper;
      ELVmethod += 60;
    } else if (a <= 1.0 || lp - std::log(1.0 - (a - 1.0) / x) < underflowLog()) {
      *lower = 1.0;
      *upper = 0.0;
      code = 1;
      ELVmethod = a <= 1.0 ? 70 : 80;
    } else {
      double J;
      if (gamma_Jax(&J, a, x) != 0) goto seriesFailure;
      const double logUpper = std::log(J) + lp;
      if (logUpper < underflowLog()) {
        *lower = 1.0;
        *upper = 0.0;
        code = 1;
        ELVmethod += 90;
      } else {
        *upper = std::exp(logUpper);
        *lower = 1.0 - *upper;
        ELVmethod += 100;
      }
    }
  } else {
    const double L = std::log(x / a) + lp;
    if (L >= underflowLog()) {
      double I;
      if (gamma_Iax(&I, a, x) != 0) goto seriesFailure;
      *lower = std::exp(L) * I;
      ELVmethod = 10;
    } else if (L - std::log(1.0 - x / (1.0 + a)) < underflowLog()) {
      *lower = 0.0;
      code = 1;
      ELVmethod = 20;
    } else {
      double I;
      if (gamma_Iax(&I, a, x) != 0) goto seriesFailure;
      const double logLower = std::log(I) + L;
      if (logLower < underflowLog()) {
        *lower = 0.0;
        code = 1;
        ELVmethod = 30;
      } else {
        *lower = std::exp(logLower);
        ELVmethod = 40;
      }
    }
    *upper = 1.0 - *lower;
  }
  ELVexit(name, code, 'F');
  return;

seriesFailure:
  ELVexit(name, 4, 'N');
}

// Newton iteration on gamma_df for the point where the lower ("L") or upper
// ("U") tail equals target; x holds the start and receives the result. The
// step is relative: it stops below 1e-9 times the larger of x and the tail
// over the density.
int gamma_newton(double* x, char mode, double target, double a) {
  static const char* const name = "gamma_newton";
  ELVstartup(name);
  double step = 0.0, scale = -1.0;
  for (long counter = 1; counter <= 35; ++counter) {
    if (std::fabs(step) < stepLimit() * scale) {
      // The last correction is below the step limit; applying it costs
      // nothing and, Newton's convergence being quadratic, leaves an error
      // far below it.
      *x += step;
      ELVsteps1 = counter;
      ELVexit(name, 0, 'N');
      return 0;
    }
    *x += step;
    double lower, upper, density = 0.0;
    gamma_df(*x, a, &lower, &upper, &density);
    if (qel::elv::threadStatus() >= 2 || !(density > 0.0)) {
      ELVexit(name, 4, 'F');
      return 4;
    }
    double r;
    if (mode == 'L') {
      r = lower / density;
      step = (target - lower) / density;
    } else {
      r = upper / density;
      step = (upper - target) / density;
    }
    scale = *x > r ? *x : r;
  }
  if (std::fabs(step) < stepLimit() * scale) {
    *x += step;
    ELVsteps1 = 36;
    ELVexit(name, 0, 'N');
    return 0;
  }
  ELVexit(name, 4, 'F');
  return 4;
}

}  // extern "C"

namespace {

// Cornish-Fisher expansion of the gamma quantile with normal deviate z.
double cornishFisherStart(double z, double a) {
  const double root = std::sqrt(a);
  const double z2 = z * z;
  return z * root + a + (z2 - 1.0) / 3.0 + (z2 - 7.0) * z / (36.0 * root) -
         ((3.0 * z2 + 7.0) * z2 - 16.0) / (810.0 * a);
}

bool quantileArgumentsRefused(double p, double a) {
  return anyNan(p, a) || p < kMinQuantileP || p > kMaxQuantileP || a <= 0.0 || a >= kMaxShape;
}

}  // namespace

extern "C" {

// Point q with Q(a, q) = p.
void gamma_upper_quant(double p, double a, double* q) {
  static const char* const name = "gamma_upper_quant";
  ELVstartup(name);
  if (quantileArgumentsRefused(p, a)) {
    *q = -kHuge;
    ELVexit(name, 2, 'F');
    return;
  }
  if (a < 1.5097878337431298e-15) {
    *q = 0.0;
    ELVmethod = 0;
    ELVexit(name, 1, 'N');
    return;
  }
  int64_t method;
  int code = 0;
  if (a <= 1.0) {
    double lower, upper, density;
    gamma_df(1.0, a, &lower, &upper, &density);
    if (upper >= p) {
      *q = 1.0;
      code = gamma_newton(q, 'U', p, a);
      method = 1;
    } else {
      // Near 0, P(a,q) is q^a / Gamma(1+a): solve q^a = (1-p) Gamma(1+a),
      // with ln Gamma(1+a) = log(1 - a gammod(a)).
      const double s = (logs(-p) + logs(-gammod(a) * a)) / a;
      if (s < underflowLog()) {
        *q = 0.0;
        method = 2;
        code = 1;
      } else {
        *q = std::exp(s);
        if (*q < seriesCutoff()) {
          method = 3;
        } else {
          code = gamma_newton(q, 'U', p, a);
          method = 4;
        }
      }
    }
  } else {
    double z;
    normal_upper_quant(p, &z);
    *q = cornishFisherStart(z, a);
    method = 5;
    if (a <= 10000.0) {
      code = gamma_newton(q, 'U', p, a);
      method = 6;
    }
  }
  ELVmethod = method;
  ELVexit(name, code, 'N');
}

// Point q with P(a, q) = p.
void gamma_lower_quant(double p, double a, double* q) {
  static const char* const name = "gamma_lower_quant";
  ELVstartup(name);
  if (quantileArgumentsRefused(p, a)) {
    *q = -kHuge;
    ELVexit(name, 2, 'F');
    return;
  }
  if (a < 0.001046505180202758) {
    *q = 0.0;
    ELVmethod = 0;
    ELVexit(name, 1, 'N');
    return;
  }
  int64_t method;
  int code = 0;
  if (a <= 1.0) {
    // Near 0, P(a,q) is q^a / Gamma(1+a).
    const double s = (std::log(p) + logs(-gammod(a) * a)) / a;
    if (s < underflowLog()) {
      *q = 0.0;
      method = 1;
      code = 1;
    } else {
      *q = std::exp(s);
      if (*q < seriesCutoff()) {
        method = 2;
      } else {
        code = gamma_newton(q, 'L', p, a);
        method = 3;
      }
    }
  } else if (a <= 10.0) {
    *q = a - 1.0;  // the mode: P is convex below it
    code = gamma_newton(q, 'L', p, a);
    method = 4;
  } else {
    double z;
    normal_upper_quant(p, &z);
    *q = cornishFisherStart(-z, a);
    method = 5;
    if (a <= 10000.0) {
      code = gamma_newton(q, 'L', p, a);
      method = 6;
    }
  }
  ELVmethod = method;
  ELVexit(name, code, 'N');
}

}  // extern "C"
