// Helpers of the incomplete beta ratio (ACM TOMS 708, DiDonato & Morris
// 1992): the prefactor x^a y^b / Beta(a, b) (brcomp, brcmp1), ln Beta
// (betaln) and its pieces (algdiv, bcorr, gsumln), ln(1 + a) (alnrel) and
// exp(mu + x) without intermediate overflow (esum).
#include <algorithm>
#include <cmath>
#include <limits>

#include "utilities/higher_functions/incomplete_beta.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

namespace {

// Stirling correction coefficients: del(x) ~ sum c[k] / x^(2k+1).
const double kStirling[6] = {.833333333333333e-01,  -.277777777760991e-02, .793650666825390e-03,
                             -.595202931351870e-03, .837308034031215e-03,  -.165322962780713e-02};
const double kRoot2PiInverse = .398942280401433e+00;  // 1/sqrt(2 pi)

// del(b) - del(a + b) for the larger argument b >= 8, with c = a/(a + b) and
// x = b/(a + b) as the caller forms them for accuracy:
// (c/b) sum c_k s_(2k+1) / b^(2k), s_n = (1 - x^n)/(1 - x).
double stirlingDifference(double c, double x, double b) {
  const double x2 = x * x;
  const double s3 = 1.0 + (x + x2);
  const double s5 = 1.0 + (x + x2 * s3);
  const double s7 = 1.0 + (x + x2 * s5);
  const double s9 = 1.0 + (x + x2 * s7);
  const double s11 = 1.0 + (x + x2 * s9);
  const double t = (1.0 / b) * (1.0 / b);
  const double w = ((((kStirling[5] * s11 * t + kStirling[4] * s9) * t + kStirling[3] * s7) * t +
                     kStirling[2] * s5) *
                        t +
                    kStirling[1] * s3) *
                       t +
                   kStirling[0];
  return w * (c / b);
}

// 1/Gamma(a0 + b0 + 1) for a0 + b0 <= 2, formed from gam1 on whichever of
// a0 + b0 and a0 + b0 - 1 lies in its range.
double gammaOfSumFactor(double a0, double b0) {
  const double apb = a0 + b0;
  if (apb > 1.0) return (1.0 + gam1(a0 + b0 - 1.0)) / apb;
  return 1.0 + gam1(apb);
}

// x^a y^b / Beta(a, b) with every exponential formed by expo(z).
template <class Exp>
double prefactor(double a, double b, double x, double y, Exp expo) {
  if (x == 0.0 || y == 0.0) return 0.0;
  const double a0 = std::min(a, b);
  if (a0 >= 8.0) {
    // Both large: deviations of x, y from a/(a+b), b/(a+b) through rlog1.
    double h, x0, y0, lambda;
    if (a <= b) {
      h = a / b;
      x0 = h / (1.0 + h);
      y0 = 1.0 / (1.0 + h);
      lambda = a - (a + b) * x;
    } else {
      h = b / a;
      x0 = 1.0 / (1.0 + h);
      y0 = h / (1.0 + h);
      lambda = (a + b) * y - b;
    }
    double e = -lambda / a;
    const double u = (std::fabs(e) > 0.6) ? e - std::log(x / x0) : rlog1(e);
    e = lambda / b;
    const double v = (std::fabs(e) > 0.6) ? e - std::log(y / y0) : rlog1(e);
    const double z = expo(-(a * u + b * v));
    return kRoot2PiInverse * std::sqrt(b * x0) * z * std::exp(-bcorr(a, b));
  }
  double lnx, lny;
  if (x <= 0.375) {
    lnx = std::log(x);
    lny = alnrel(-x);
  } else if (y <= 0.375) {
    lnx = alnrel(-y);
    lny = std::log(y);
  } else {
    lnx = std::log(x);
    lny = std::log(y);
  }
  double z = a * lnx + b * lny;
  if (a0 >= 1.0) return expo(z - betaln(a, b));
  double b0 = std::max(a, b);
  if (b0 >= 8.0) {
    const double u = gamln1(a0) + algdiv(a0, b0);
    return a0 * expo(z - u);
  }
  if (b0 <= 1.0) {
    const double value = expo(z);
    if (value == 0.0) return 0.0;
    const double c = (1.0 + gam1(a)) * (1.0 + gam1(b)) / gammaOfSumFactor(a, b);
    return value * (a0 * c) / (1.0 + a0 / b0);
  }
  // 1 < b0 < 8.
  double u, k, t;
  smallShapeFactors(a0, b0, &u, &k, &t);
  return a0 * expo(z - u) * k / t;
}

// The last shapes and value of a function of the two shapes, per thread.
// The distribution functions call the ratio over and over at the same shapes
// (array forms, grids, quantile searches), and one call can need ln Beta(a, b)
// twice (the bup and bpser pieces of BRATIO); the lookup replaces the
// log-gamma work by two comparisons. NaN keys match nothing.
struct ShapeMemo {
  double a = std::numeric_limits<double>::quiet_NaN();
  double b = std::numeric_limits<double>::quiet_NaN();
  double value = 0.0;
};
// initial-exec: an offset from the thread pointer, no __tls_get_addr call.
thread_local ShapeMemo lastLnBeta __attribute__((tls_model("initial-exec")));
thread_local ShapeMemo lastBcorr __attribute__((tls_model("initial-exec")));

// Both functions are symmetric in the shapes: either order matches.
template <class F>
double memoised(ShapeMemo& memo, double a, double b, F f) {
  if ((a == memo.a && b == memo.b) || (a == memo.b && b == memo.a)) return memo.value;
  const double value = f(a, b);
  memo.a = a;
  memo.b = b;
  memo.value = value;
  return value;
}

double lnBetaDirect(double a0, double b0);
double bcorrDirect(double a0, double b0);

// The factors of smallShapeFactors for the last shapes of each thread.
struct FactorMemo {
  double a0 = std::numeric_limits<double>::quiet_NaN();
  double b0 = std::numeric_limits<double>::quiet_NaN();
  double u = 0.0;
  double k = 0.0;
  double t = 0.0;
};
thread_local FactorMemo lastSmallShape __attribute__((tls_model("initial-exec")));

}  // namespace

void smallShapeFactors(double a0, double b0, double* u, double* k, double* t) {
  FactorMemo& memo = lastSmallShape;
  if (!(a0 == memo.a0 && b0 == memo.b0)) {
    // Gamma(b0) = (b0 - 1) Gamma(b0 - 1) down to b0 in (0, 1].
    double lnFactor = gamln1(a0);
    double b = b0;
    const int n = static_cast<int>(b - 1.0);
    if (n >= 1) {
      double c = 1.0;
      for (int i = 1; i <= n; ++i) {
        b -= 1.0;
        c *= b / (a0 + b);
      }
      lnFactor += std::log(c);
    }
    b -= 1.0;
    memo.u = lnFactor;
    memo.k = 1.0 + gam1(b);
    memo.t = gammaOfSumFactor(a0, b);
    memo.a0 = a0;
    memo.b0 = b0;
  }
  *u = memo.u;
  *k = memo.k;
  *t = memo.t;
}

double brcomp(double a, double b, double x, double y) {
  return prefactor(a, b, x, y, [](double z) { return std::exp(z); });
}

double brcmp1(int mu, double a, double b, double x, double y) {
  return prefactor(a, b, x, y, [mu](double z) { return esum(mu, z); });
}

double betaln(double a0, double b0) {
  return memoised(lastLnBeta, a0, b0, lnBetaDirect);
}

double bcorr(double a0, double b0) {
  return memoised(lastBcorr, a0, b0, bcorrDirect);
}

namespace {

double lnBetaDirect(double a0, double b0) {
  const double e = .918938533204673e+00;  // ln(2 pi)/2
  double a = std::min(a0, b0);
  double b = std::max(a0, b0);
  if (a >= 8.0) {
    const double w = bcorr(a, b);
    const double h = a / b;
    const double c = h / (1.0 + h);
    const double u = -(a - 0.5) * std::log(c);
    const double v = b * alnrel(h);
    if (u > v) return (((-0.5 * std::log(b) + e) + w) - v) - u;
    return (((-0.5 * std::log(b) + e) + w) - u) - v;
  }
  if (a < 1.0) {
    if (b < 8.0) return gamln(a) + (gamln(b) - gamln(a + b));
    return gamln(a) + algdiv(a, b);
  }
  // 1 <= a < 8.
  double w = 0.0;
  if (a <= 2.0) {
    if (b <= 2.0) return gamln(a) + gamln(b) - gsumln(a, b);
    if (b >= 8.0) return gamln(a) + algdiv(a, b);
  } else if (b > 1.0e3) {
    // Reduce a towards (1, 2] with b large.
    const int n = static_cast<int>(a - 1.0);
    double prod = 1.0;
    for (int i = 1; i <= n; ++i) {
      a -= 1.0;
      prod *= a / (1.0 + a / b);
    }
    return (std::log(prod) - n * std::log(b)) + (gamln(a) + algdiv(a, b));
  } else {
    const int n = static_cast<int>(a - 1.0);
    double prod = 1.0;
    for (int i = 1; i <= n; ++i) {
      a -= 1.0;
      const double h = a / b;
      prod *= h / (1.0 + h);
    }
    w = std::log(prod);
    if (b >= 8.0) return w + gamln(a) + algdiv(a, b);
  }
  // Reduce b towards (1, 2] with b < 8.
  const int n = static_cast<int>(b - 1.0);
  double z = 1.0;
  for (int i = 1; i <= n; ++i) {
    b -= 1.0;
    z *= b / (a + b);
  }
  return w + std::log(z) + (gamln(a) + (gamln(b) - gsumln(a, b)));
}

double bcorrDirect(double a0, double b0) {
  const double a = std::min(a0, b0);
  const double b = std::max(a0, b0);
  const double h = a / b;
  const double w = stirlingDifference(h / (1.0 + h), 1.0 / (1.0 + h), b);
  const double t = (1.0 / a) * (1.0 / a);
  const double del =
      (((((kStirling[5] * t + kStirling[4]) * t + kStirling[3]) * t + kStirling[2]) * t +
        kStirling[1]) *
           t +
       kStirling[0]) /
      a;
  return del + w;
}

}  // namespace

double algdiv(double a, double b) {
  // c = a/(a + b) and x = b/(a + b), each formed from the smaller ratio.
  double c, x, d;
  if (a <= b) {
    const double h = a / b;
    c = h / (1.0 + h);
    x = 1.0 / (1.0 + h);
    d = b + (a - 0.5);
  } else {
    const double h = b / a;
    c = 1.0 / (1.0 + h);
    x = h / (1.0 + h);
    d = a + (b - 0.5);
  }
  const double w = stirlingDifference(c, x, b);
  const double u = d * alnrel(a / b);
  const double v = a * (std::log(b) - 1.0);
  if (u > v) return (w - v) - u;
  return (w - u) - v;
}

double gsumln(double a, double b) {
  const double x = a + b - 2.0;
  if (x <= 0.25) return gamln1(1.0 + x);
  if (x <= 1.25) return gamln1(x) + alnrel(x);
  return gamln1(x - 1.0) + std::log(x * (1.0 + x));
}

double alnrel(double a) {
  const double p1 = -.129418923021993e+01, p2 = .405303492862024e+00, p3 = -.178874546012214e-01;
  const double q1 = -.162752256355323e+01, q2 = .747811014037616e+00, q3 = -.845104217945565e-01;
  if (std::fabs(a) > 0.375) return std::log(1.0 + a);
  const double t = a / (a + 2.0);
  const double t2 = t * t;
  const double w =
      (((p3 * t2 + p2) * t2 + p1) * t2 + 1.0) / (((q3 * t2 + q2) * t2 + q1) * t2 + 1.0);
  return 2.0 * t * w;
}

double esum(int mu, double x) {
  // Add mu and x only when they have opposite signs, so that the sum cannot
  // overflow; otherwise multiply the two exponentials.
  if (x > 0.0) {
    if (mu <= 0) {
      const double w = mu + x;
      if (w >= 0.0) return std::exp(w);
    }
  } else {
    if (mu >= 0) {
      const double w = mu + x;
      if (w <= 0.0) return std::exp(w);
    }
  }
  return std::exp(static_cast<double>(mu)) * std::exp(x);
}

}  // namespace qel
