// Quantiles of the beta law: Newton's method on beta_df from a starting
// value chosen by region of the shape plane.
//
// The lower tail near 0 is about x^a / (a B(a,b)), which gives the start for
// a shape below 1; for large shapes the Cornish-Fisher expansion about the
// mean (Johnson, Kotz & Balakrishnan, Continuous Univariate Distributions,
// vol. 2, ch. 25) is the start, and above c = ab/(a+b) = 20000 the answer.
// Otherwise Newton starts at the mode, where the distribution function
// changes from convex to concave, so that the iteration approaches the root
// from one side. Where the quantile lies near 1 the iteration runs on the
// upper tail of the exchanged law, so that 1 - x keeps its relative accuracy.
#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

constexpr int kNewtonSteps = 500;
constexpr double kEpsilon = 2.220446049250313e-16;
constexpr double kMinShapeQ = 0.001;

double lowerAt(double x, double a, double b) {
  double lower = 0.0, upper = 0.0, density = 0.0;
  beta_df(x, a, b, &lower, &upper, &density);
  return lower;
}

double upperAt(double x, double a, double b) {
  double lower = 0.0, upper = 0.0, density = 0.0;
  beta_df(x, a, b, &lower, &upper, &density);
  return upper;
}

// Keeps a Newton point inside (0, 1). Leaving through 0 means a step from
// the right across a tail that behaves like x^a: the step is then taken on
// the logarithms, which is exact for a pure power.
double keepInside(double x, double next, char mode, double target, double tail, double r) {
  if (next >= 1.0) return 0.5 * (x + 1.0);
  if (next > 0.0) return next;
  if (mode == 'L' && tail > 0.0) {
    double e = (std::log(target) - std::log(tail)) * r / x;
    if (e < -700.0) e = -700.0;
    if (e > 0.0) e = 0.0;
    return x * std::exp(e);
  }
  return 0.5 * x;
}

// The outcome of a region: a lower output x (upper 1 - x), or an upper
// output y (lower 1 - y) for a quantile near 1.
struct Outcome {
  double lower, upper;
  int code;
};

Outcome fromLower(double x, int code) {
  return {x, 1.0 - x, code};
}

Outcome fromUpper(double y, int code) {
  return {1.0 - y, y, code};
}

Outcome newtonLower(double start, double p, double a, double b) {
  double x = start;
  const int code = beta_newton(&x, 'L', p, a, b);
  return fromLower(x, code);
}

// Newton on the upper tail of the exchanged law (b, a): its point y is
// 1 minus the quantile.
Outcome newtonUpperExchanged(double start, double p, double a, double b) {
  double y = start;
  const int code = beta_newton(&y, 'U', p, b, a);
  return fromUpper(y, code);
}

// Shapes a <= b <= 1 or the region left of the antimode: the quantile lies
// where the lower tail is close to its power law.
Outcome smallLower(double p, double a, double b, int64_t first, int64_t* method) {
  if (lowerAt(kTinyArgument, a, b) > p) {
    *method = first;
    return fromLower(0.0, 1);
  }
  double q1, q2;
  beta_quant0(-1, &q1, &q2, p, a, b);
  if (q2 < 0.001) {
    *method = first + 1;
    return newtonLower(q2, p, a, b);
  }
  *method = first + 2;
  return newtonLower(q1, p, a, b);
}

// Quantile above 1/2 with b <= 1 or a <= 1: near 1 the upper tail is about
// (1-x)^b / (b B(a,b)); solved on the exchanged law.
Outcome nearOne(double p, double a, double b, int64_t* method) {
  if (upperAt(kTinyArgument, b, a) < p) {
    *method = 51;
    return fromUpper(0.0, 1);
  }
  double q1, q2;
  beta_quant0(1, &q1, &q2, p, b, a);
  double start;
  if (b <= 1.0 && a >= 1.0) {
    *method = 52;
    start = q2;
  } else if (q2 < 0.001) {
    *method = 61;
    start = q2;
  } else {
    *method = 62;
    start = q1;
  }
  return newtonUpperExchanged(start, p, a, b);
}

Outcome chooseAndSolve(double p, double a, double b, int64_t* method) {
  const double c = a * b / (a + b);
  double q1, q2;
  if (a <= 1.0 && b >= 1.0) {
    if (lowerAt(kTinyArgument, a, b) > p) {
      *method = 11;
      return fromLower(0.0, 1);
    }
    beta_quant0(-1, &q1, &q2, p, a, b);
    *method = 12;
    return newtonLower(q2, p, a, b);
  }
  if (b <= 1.0 && a >= 1.0) {
    if (lowerAt(0.5, a, b) >= p) {
      beta_quant0(-1, &q1, &q2, p, a, b);
      *method = 20;
      return newtonLower(q2 < 0.5 ? q2 : 0.5, p, a, b);
    }
    return nearOne(p, a, b, method);
  }
  if (a <= b && b <= 1.0) return smallLower(p, a, b, 31, method);
  if (b <= a && a <= 1.0) {
    if (lowerAt(0.5, a, b) >= p) {
      // Both shapes below 1: the density is least at the antimode; right of
      // it the lower tail is convex.
      const double antimode = (a - 1.0) / (a + b - 2.0);
      if (p > lowerAt(antimode, a, b)) {
        beta_quant0(-1, &q1, &q2, p, a, b);
        *method = 41;
        return newtonLower(q2 < 0.5 ? q2 : 0.5, p, a, b);
      }
      return smallLower(p, a, b, 42, method);
    }
    return nearOne(p, a, b, method);
  }
  if (c > 20000.0) {
    if (a <= b) {
      beta_quant0(-2, &q1, &q2, p, a, b);
      *method = 71;
      return fromLower(q1, 0);
    }
    beta_quant0(2, &q1, &q2, p, b, a);
    *method = 72;
    return fromUpper(q1, 0);
  }
  if (c >= 10.0) {
    beta_quant0(-2, &q1, &q2, p, a, b);
    if (a <= b) {
      *method = 81;
      return newtonLower(q1, p, a, b);
    }
    if (q1 > 0.5) {
      beta_quant0(2, &q1, &q2, p, b, a);
      *method = 83;
      return newtonUpperExchanged(q1, p, a, b);
    }
    *method = 82;
    return newtonLower(q1, p, a, b);
  }
  const double mode = (a - 1.0) / (a + b - 2.0);
  if (a <= b) {
    *method = 91;
    return newtonLower(mode, p, a, b);
  }
  if (lowerAt(0.5, a, b) >= p) {
    *method = 92;
    return newtonLower(mode, p, a, b);
  }
  *method = 93;
  return newtonUpperExchanged((b - 1.0) / (a + b - 2.0), p, a, b);
}

bool quantileRefused(double p, double a, double b) {
  return anyNan(p, a, b) || p < kMinQuantileP || p > kMaxQuantileP || a < kMinShapeQ ||
         b < kMinShapeQ || a >= kMaxShape || b >= kMaxShape;
}

}  // namespace

extern "C" {

int beta_newton(double* x, char mode, double target, double a, double b) {
  static const char* const name = "beta_newton";
  ELVstartup(name);
  double point = *x;
  double twoBack = 0.0, oneBack = 0.0;
  for (int steps = 1; steps <= kNewtonSteps; ++steps) {
    double lower = 0.0, upper = 0.0, density = 0.0;
    beta_df(point, a, b, &lower, &upper, &density);
    if (qel::elv::threadStatus() > 1 || !(density > 0.0)) {
      ELVsteps1 = steps;
      ELVexit(name, 4, 'F');
      return 4;
    }
    const double tail = mode == 'L' ? lower : upper;
    const double r = tail / density;
    const double step = mode == 'L' ? (target - lower) / density : (upper - target) / density;
    const double scale = point > r ? point : r;
    if (std::fabs(step) <= stepLimit() * scale) {
      // The last correction is below the tolerance; applying it costs
      // nothing and halves the remaining digits of error.
      const double last = point + step;
      *x = (last > 0.0 && last < 1.0) ? last : point;
      ELVsteps1 = steps;
      ELVexit(name, 0, 'N');
      return 0;
    }
    double next = point + step;
    // A two-cycle of the iteration: take half the step.
    if (steps > 2 && std::fabs(next - twoBack) < kEpsilon) next = point + 0.5 * step;
    next = keepInside(point, next, mode, target, tail, r);
    twoBack = oneBack;
    oneBack = point;
    point = next;
  }
  *x = point;
  ELVsteps1 = kNewtonSteps;
  ELVexit(name, 4, 'F');
  return 4;
}

void beta_quant0(int mode, double* q1, double* q2, double p, double a, double b) {
  if (mode == -1 || mode == 1) {
    // x^a / (a B(a,b)) = p (lower tail, mode -1) or 1 - p (mode 1). q1
    // drops the beta function, q2 keeps it, written through the scaled
    // gamma function so that it stays accurate for large shapes.
    const double s = mode == -1 ? std::log(p) : logs(-p);
    *q1 = s / a < kUnderflowLog ? kTinyArgument : std::exp(s / a);
    const double lnInverseAB = -std::log(a + b) + std::log(b) - ln_scaled_gamma(a) -
                               ln_scaled_gamma(b) + ln_scaled_gamma(a + b) + a * logs(b / a) +
                               b * logs(a / b);
    const double e = (s - lnInverseAB) / a;
    *q2 = e < kUnderflowLog ? kTinyArgument : std::exp(e);
    return;
  }
  // Cornish-Fisher expansion with the normal deviate of the lower tail
  // (mode -2) or of the upper tail (mode 2).
  double z;
  if (p <= 0.5) {
    normal_upper_quant(p, &z);
  } else {
    normal_upper_quant(1.0 - p, &z);
    z = -z;
  }
  if (mode == -2) z = -z;
  const double mu = a / (a + b);
  const double s = a * b / (a + b);
  const double v = mu * (1.0 - mu);
  const double w = (1.0 - 2.0 * mu) * v;
  const double rs = std::sqrt(s);
  const double z2 = z * z;
  *q1 = mu + z * v / rs + (z2 - 1.0) * w / (3.0 * s) +
        ((1.0 - 13.0 * v) * z2 - (7.0 - 37.0 * v)) * z * v / (36.0 * s * rs) -
        ((3.0 * (1.0 + 23.0 * v) * z2 + (7.0 - 379.0 * v)) * z2 - 4.0 * (4.0 - 43.0 * v)) * w /
            (810.0 * s * s);
  *q2 = *q1;
}

int beta_quant(double* lower, double* upper, double p, double a, double b) {
  int64_t method = 0;
  const Outcome outcome = chooseAndSolve(p, a, b, &method);
  *lower = outcome.lower;
  *upper = outcome.upper;
  ELVmethod = method;
  qel::elv::storeStatus(outcome.code);
  return outcome.code;
}

// Point q with P(X > q) = p: 1 minus the lower quantile of the exchanged law.
void beta_upper_quant(double p, double a, double b, double* q) {
  static const char* const name = "beta_upper_quant";
  ELVstartup(name);
  if (quantileRefused(p, a, b)) {
    *q = -kHuge;
    ELVexit(name, 2, 'F');
    return;
  }
  double lower, upper;
  const int code = beta_quant(&lower, &upper, p, b, a);
  *q = upper;
  ELVexit(name, code, 'F');
}

// Point q with P(X <= q) = p.
void beta_lower_quant(double p, double a, double b, double* q) {
  static const char* const name = "beta_lower_quant";
  ELVstartup(name);
  if (quantileRefused(p, a, b)) {
    *q = -kHuge;
    ELVexit(name, 2, 'F');
    return;
  }
  double lower, upper;
  const int code = beta_quant(&lower, &upper, p, a, b);
  *q = lower;
  ELVexit(name, code, 'F');
}

}  // extern "C"
