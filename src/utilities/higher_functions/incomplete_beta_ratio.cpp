// Incomplete beta ratio I_x(a, b): the driver BRATIO of ACM TOMS 708
// (DiDonato & Morris 1992) with its region logic, and the series
// procedures fpser, apser, bpser and bup. The digamma in apser comes from a
// private order-0 copy of the polygamma routine (SLATEC DPSIFN).
#include <algorithm>
#include <cmath>

#include "utilities/higher_functions/incomplete_beta.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

namespace {

const double kEuler = .577215664901533e+00;

// -psi(x): DPSIFN fixed to order 0, kode 1 and one term. ierr as XDPSIFN;
// on an error the answer is 0.
double negativeDigamma(double x, int* ierr) {
  *ierr = 0;
  if (!(x > 0.0)) {
    *ierr = 1;
    return 0.0;
  }
  const double r1m5 = D1MACH(5);
  const double wdtol = std::max(D1MACH(4) * 0.5, 0.5e-18);
  const double elim = 2.302 * (std::min(-I1MACH(15), I1MACH(16)) * r1m5 - 3.0);
  const double xln = std::log(x);
  if (std::fabs(xln) > elim) {
    // Beyond the limits the published routine answers 0 (underflow) or fails.
    if (xln <= 0.0) *ierr = 2;
    return 0.0;
  }
  if (x < wdtol) return 1.0 / x;
  const double rln = std::min(r1m5 * I1MACH(14), 18.06);
  const double fln = std::max(rln, 3.0) - 3.0;
  const double xmin = static_cast<int>(3.50 + 0.40 * fln) + 1;
  double xdmy = x, xdmln = xln, xinc = 0.0;
  if (x < xmin) {
    xinc = xmin - static_cast<int>(x);
    xdmy = x + xinc;
    xdmln = std::log(xdmy);
  }
  // Terms beyond the exponent range count as underflow, as in the full routine.
  if (2.0 * std::fabs(xdmln) > elim) return 0.0;
  // -psi(y) + ln y = 1/(2y) + sum B_2k/(2k y^2k).
  const double tt = 0.5 / xdmy;
  const double tst = wdtol * tt;
  const double rxsq = 1.0 / (xdmy * xdmy);
  double t = 0.5 * rxsq;
  double s = t * kDpsifnBernoulli[3];
  if (std::fabs(s) >= tst) {
    double tk = 2.0;
    for (int k = 4; k <= 22; ++k) {
      t = t * ((tk + 1.0) / (tk + 1.0)) * (tk / (tk + 2.0)) * rxsq;
      const double term = t * kDpsifnBernoulli[k];
      if (std::fabs(term) < tst) break;
      s += term;
      tk += 2.0;
    }
  }
  s += tt;
  const int nx = static_cast<int>(xinc);
  for (int i = 1; i <= nx; ++i) s += 1.0 / (x + (nx - i));
  return s - xdmln;
}

}  // namespace

double fpser(double a, double b, double x, double eps) {
  double result = 1.0;
  if (a > 1.e-3 * eps) {
    const double t = a * std::log(x);
    if (t < exparg(1)) return 0.0;
    result = std::exp(t);
  }
  // 1/Beta(a, b) is b to double precision here.
  result *= b / a;
  const double tol = eps / a;
  double an = a + 1.0;
  double t = x;
  double s = t / an;
  double c;
  do {
    an += 1.0;
    t *= x;
    c = t / an;
    s += c;
  } while (std::fabs(c) > tol);
  return result * (1.0 + a * s);
}

double apser(double a, double b, double x, double eps) {
  const double bx = b * x;
  double t = x - bx;
  double c;
  if (b * eps <= 2.e-2) {
    int ierr = 0;
    const double digamma = -negativeDigamma(b, &ierr);
    c = std::log(x) + digamma + kEuler + t;
  } else {
    c = std::log(bx) + kEuler + t;
  }
  const double tol = 5.0 * eps * std::fabs(c);
  double j = 1.0;
  double s = 0.0;
  double aj;
  do {
    j += 1.0;
    t *= x - bx / j;
    aj = t / j;
    s += aj;
  } while (std::fabs(aj) > tol);
  return -a * (c + s);
}

double bpser(double a, double b, double x, double eps) {
  if (x == 0.0) return 0.0;
  // The factor x^a / (a Beta(a, b)).
  double result;
  double a0 = std::min(a, b);
  if (a0 >= 1.0) {
    result = std::exp(a * std::log(x) - betaln(a, b)) / a;
  } else {
    double b0 = std::max(a, b);
    if (b0 >= 8.0) {
      const double u = gamln1(a0) + algdiv(a0, b0);
      result = (a0 / a) * std::exp(a * std::log(x) - u);
    } else if (b0 <= 1.0) {
      result = std::pow(x, a);
      if (result == 0.0) return 0.0;
      const double apb = a + b;
      const double z = (apb > 1.0) ? (1.0 + gam1(a + b - 1.0)) / apb : 1.0 + gam1(apb);
      const double c = (1.0 + gam1(a)) * (1.0 + gam1(b)) / z;
      result *= c * (b / apb);
    } else {
      // 1 < b0 < 8: b0 shifted down into (0, 1], the same factors as the
      // prefactor of bup (remembered for the last shapes).
      double u, k, t;
      smallShapeFactors(a0, b0, &u, &k, &t);
      result = std::exp(a * std::log(x) - u) * (a0 / a) * k / t;
    }
  }
  if (result == 0.0 || a <= 0.1 * eps) return result;
  // The series sum of c_n/(a + n), c_n = (1 - b/1)...(1 - b/n) x^n. One
  // division per term: with q = 1/(n (a + n)), the term is
  // c_(n-1) (n - b) x q and c_n = c_(n-1) (n - b) x (a + n) q; n - b is exact
  // near n = b, so the factor keeps its digits where it nears 0. The chain
  // from term to term is one multiplication.
  double sum = 0.0;
  double n = 0.0;
  double c = 1.0;
  const double tol = eps / a;
  double w;
  do {
    n += 1.0;
    const double apn = a + n;
    const double q = 1.0 / (n * apn);
    const double h = (n - b) * x * q;
    w = c * h;
    c *= h * apn;
    sum += w;
  } while (std::fabs(w) > tol);
  return result * (1.0 + a * sum);
}

double bup(double a, double b, double x, double y, int n, double eps) {
  const double apb = a + b;
  const double ap1 = a + 1.0;
  int mu = 0;
  double d = 1.0;
  if (n != 1 && a >= 1.0 && apb >= 1.1 * ap1) {
    // Scale the first term by exp(mu) so that its successors do not underflow.
    // Machine constants: formed once, not on every call.
    static const int kMu =
        std::min(static_cast<int>(std::fabs(exparg(1))), static_cast<int>(exparg(0)));
    static const double kScale = std::exp(-static_cast<double>(kMu));
    mu = kMu;
    d = kScale;
  }
  const double first = brcmp1(mu, a, b, x, y) / a;
  if (n == 1 || first == 0.0) return first;
  const int nm1 = n - 1;
  double w = d;
  // k: index of the largest term; the terms before it are added untested.
  int k = 0;
  if (b > 1.0) {
    if (y > 1.e-4) {
      const double r = (b - 1.0) * x / y - a;
      if (r >= 1.0) k = (r < nm1) ? static_cast<int>(r) : nm1;
    } else {
      k = nm1;
    }
  }
  for (int i = 1; i <= k; ++i) {
    const double l = i - 1;
    d = ((apb + l) / (ap1 + l)) * x * d;
    w += d;
  }
  for (int i = k + 1; i <= nm1; ++i) {
    const double l = i - 1;
    d = ((apb + l) / (ap1 + l)) * x * d;
    w += d;
    if (d <= eps * w) break;
  }
  return first * w;
}

// lambda = a - (a + b) x = (a + b) y - b, formed from the smaller of x and
// y (the one a caller holds exactly; the other is 1 minus it, rounded), with
// a + b as an exact sum s + t and the product s x (or s y) exact by fma
// (Dekker's two-product), where TOMS 708 forms a - (a + b) x in plain
// arithmetic. The rounding of (a + b) x, some eps (a + b), costs lambda the
// relative accuracy eps sqrt(a + b) / |z| at z standard deviations (4e-14 at
// a = b = 1e6, z = 3; the whole spread sqrt(a b / (a + b)) of lambda beyond
// a + b = 2^106); basym (DLMF 8.18.9, Temme's uniform expansion) and bfrac
// then work from a lambda that has kept its digits.
namespace {

double exactLambda(double a, double b, double x, double y) {
  const double s = a + b;
  const double bs = s - a;
  const double t = (a - (s - bs)) + (b - bs);  // a + b = s + t exactly
  if (x <= y) {
    const double product = s * x;
    return ((a - product) - std::fma(s, x, -product)) - t * x;
  }
  const double product = s * y;
  return ((product - b) + std::fma(s, y, -product)) + t * y;
}

}  // namespace

void BRATIO(double a, double b, double x, double y, double* w, double* w1, int* ierr) {
  // The machine precision (a power through pow): formed once, not per call.
  static const double kMachineEps = spmpar(1);
  double eps = kMachineEps;
  *w = 0.0;
  *w1 = 0.0;
  // Written so that NaN fails each test (and infinite a or b counts as
  // invalid): the series and fractions below would not end on them.
  if (!(a >= 0.0 && b >= 0.0 && a < HUGE_VAL && b < HUGE_VAL)) {
    *ierr = 1;
    return;
  }
  if (a == 0.0 && b == 0.0) {
    *ierr = 2;
    return;
  }
  if (!(x >= 0.0 && x <= 1.0)) {
    *ierr = 3;
    return;
  }
  if (!(y >= 0.0 && y <= 1.0)) {
    *ierr = 4;
    return;
  }
  if (std::fabs(((x + y) - 0.5) - 0.5) > 3.0 * eps) {
    *ierr = 5;
    return;
  }
  *ierr = 0;
  if (x == 0.0) {
    if (a == 0.0) {
      *ierr = 6;
      return;
    }
    *w = 0.0;
    *w1 = 1.0;
    return;
  }
  if (y == 0.0) {
    if (b == 0.0) {
      *ierr = 7;
      return;
    }
    *w = 1.0;
    *w1 = 0.0;
    return;
  }
  if (a == 0.0) {
    *w = 1.0;
    *w1 = 0.0;
    return;
  }
  if (b == 0.0) {
    *w = 0.0;
    *w1 = 1.0;
    return;
  }
  eps = std::max(eps, 1.e-15);
  if (std::max(a, b) < 1.e-3 * eps) {
    *w = b / (a + b);
    *w1 = a / (a + b);
    return;
  }

  // Working copies, exchanged (with ind set) so that the chosen method
  // applies; the results are exchanged back at the end.
  bool ind = false;
  double a0 = a, b0 = b, x0 = x, y0 = y;
  auto exchange = [&]() {
    ind = true;
    a0 = b;
    b0 = a;
    x0 = y;
    y0 = x;
  };
  // Each method yields w (lower) or w1 (complement); the other follows.
  auto lower = [&](double value) {
    *w = value;
    *w1 = 0.5 + (0.5 - value);
  };
  auto upper = [&](double value) {
    *w1 = value;
    *w = 0.5 + (0.5 - value);
  };
  int ierr1 = 0;
  const int nbup = 20;

  if (std::min(a0, b0) <= 1.0) {
    if (x > 0.5) exchange();
    if (b0 < std::min(eps, eps * a0)) {
      lower(fpser(a0, b0, x0, eps));
    } else if (a0 < std::min(eps, eps * b0) && b0 * x0 <= 1.0) {
      upper(apser(a0, b0, x0, eps));
    } else {
      // 0: bpser on x; 1: bpser on the complement; 2: bup then bgrat;
      // 3: bgrat alone.
      int method;
      if (std::max(a0, b0) <= 1.0) {
        if (a0 >= std::min(0.2, b0) || std::pow(x0, a0) <= 0.9) {
          method = 0;
        } else {
          method = (x0 >= 0.3) ? 1 : 2;
        }
      } else if (b0 <= 1.0) {
        method = 0;
      } else if (x0 >= 0.3) {
        method = 1;
      } else if (x0 < 0.1 && std::pow(x0 * b0, a0) <= 0.7) {
        method = 0;
      } else {
        method = (b0 > 15.0) ? 3 : 2;
      }
      switch (method) {
        case 0:
          lower(bpser(a0, b0, x0, eps));
          break;
        case 1:
          upper(bpser(b0, a0, y0, eps));
          break;
        default: {
          double value = 0.0;
          if (method == 2) {
            value = bup(b0, a0, y0, x0, nbup, eps);
            b0 += nbup;
          }
          bgrat(b0, a0, y0, x0, &value, 15.0 * eps, &ierr1);
          upper(value);
          break;
        }
      }
    }
  } else {
    double lambda = exactLambda(a, b, x, y);
    if (lambda < 0.0) {
      exchange();
      lambda = std::fabs(lambda);
    }
    if (b0 < 40.0) {
      if (b0 * x0 <= 0.7) {
        lower(bpser(a0, b0, x0, eps));
      } else {
        // Reduce b0 into (0, 1] by bup, then finish with bpser or bgrat.
        int n = static_cast<int>(b0);
        b0 -= n;
        if (b0 == 0.0) {
          n -= 1;
          b0 = 1.0;
        }
        double value = bup(b0, a0, y0, x0, n, eps);
        if (x0 <= 0.7) {
          value += bpser(a0, b0, x0, eps);
        } else {
          if (a0 <= 15.0) {
            value += bup(a0, b0, x0, y0, nbup, eps);
            a0 += nbup;
          }
          bgrat(a0, b0, x0, y0, &value, 15.0 * eps, &ierr1);
        }
        lower(value);
      }
    } else {
      const double small = std::min(a0, b0);
      if (small <= 100.0 || lambda > 0.03 * small) {
        lower(bfrac(a0, b0, x0, y0, lambda, 15.0 * eps));
      } else {
        lower(basym(a0, b0, lambda, 100.0 * eps));
      }
    }
  }
  if (ind) std::swap(*w, *w1);
}

double mIncompleteBetaRatio(double x, double y, double a, double b, bool complement) {
  double w = 0.0, w1 = 0.0;
  int ierr = 0;
  BRATIO(a, b, x, y, &w, &w1, &ierr);
  return complement ? w1 : w;
}

}  // namespace qel
