// Digamma and polygamma.
// - psi: the digamma routine of ACM TOMS 708, on the rational Chebyshev
//   approximations of Cody, Strecok & Thacher (Math. Comp. 27, 1973), with
//   reflection for x < 0.5.
// - XDPSIFN: scaled polygamma of orders n .. n+m-1 after SLATEC DPSIFN
//   (Amos, ACM TOMS 610, 1983): asymptotic expansion in Bernoulli numbers
//   for x >= xmin, upward shift of the argument to xmin below it.
#include <algorithm>
#include <cmath>
#include <stdexcept>

#include "utilities/higher_functions/transcendental.h"

namespace qel {

// Bernoulli numbers B_0, B_1, B_2, B_4, ..., B_40 (1-based in the loops below).
const double kDpsifnBernoulli[23] = {0.0,  // unused, keeps the published 1-based indices
                                     1.00000000000000000e+00,
                                     -5.00000000000000000e-01,
                                     1.66666666666666667e-01,
                                     -3.33333333333333333e-02,
                                     2.38095238095238095e-02,
                                     -3.33333333333333333e-02,
                                     7.57575757575757576e-02,
                                     -2.53113553113553114e-01,
                                     1.16666666666666667e+00,
                                     -7.09215686274509804e+00,
                                     5.49711779448621554e+01,
                                     -5.29124242424242424e+02,
                                     6.19212318840579710e+03,
                                     -8.65802531135531136e+04,
                                     1.42551716666666667e+06,
                                     -2.72982310678160920e+07,
                                     6.01580873900642368e+08,
                                     -1.51163157670921569e+10,
                                     4.29614643061166667e+11,
                                     -1.37116552050883328e+13,
                                     4.88332318973593167e+14,
                                     -1.92965793419400681e+16};

namespace {

const int kNmax = 100;

// -pi cot(pi x) for x < 0.5 away from the poles, from sin/cos of the first
// quadrant after reduction of 4x; *pole is set at a pole.
double reflectionTerm(double x, double xmax1, bool* pole) {
  const double piov4 = .785398163397448e+00;
  double w = -x;
  double sgn = piov4;
  if (w <= 0.0) {
    w = -w;
    sgn = -sgn;
  }
  if (w >= xmax1) {
    *pole = true;
    return 0.0;
  }
  w -= std::floor(w);
  int nq = static_cast<int>(w * 4.0);
  w = 4.0 * (w - nq * .25);
  int n = nq / 2;
  if (n + n != nq) w = 1.0 - w;
  const double z = piov4 * w;
  int m = n / 2;
  if (m + m != n) sgn = -sgn;
  n = (nq + 1) / 2;
  m = n / 2;
  m += m;
  if (m == n) {
    if (z == 0.0) {
      *pole = true;
      return 0.0;
    }
    return sgn * ((std::cos(z) / std::sin(z)) * 4.0);
  }
  return sgn * ((std::sin(z) / std::cos(z)) * 4.0);
}

}  // namespace

double psi(double x) {
  static const double p1[7] = {.895385022981970e-02, .477762828042627e+01, .142441585084029e+03,
                               .118645200713425e+04, .363351846806499e+04, .413810161269013e+04,
                               .130560269827897e+04};
  static const double q1[6] = {.448452573429826e+02, .520752771467162e+03, .221000799247830e+04,
                               .364127349079381e+04, .190831076596300e+04, .691091682714533e-05};
  static const double p2[4] = {-.212940445131011e+01, -.701677227766759e+01, -.448616543918019e+01,
                               -.648157123766197e+00};
  static const double q2[4] = {.322703493791143e+02, .892920700481861e+02, .546117738103215e+02,
                               .777788548522962e+01};
  const double dx0 = 1.461632144968362341262659542325721325e+00;  // zero of psi
  const double xsmall = 1.0e-09;
  const double xmax1 = std::min(static_cast<double>(ipmpar(3)), 1.0 / spmpar(1));
  double aug = 0.0;
  if (x < 0.5) {
    if (std::fabs(x) <= xsmall) {
      if (x == 0.0) return 0.0;
      // pi cot(pi x) is 1/x to double precision here.
      aug = -1.0 / x;
    } else {
      bool pole = false;
      aug = reflectionTerm(x, xmax1, &pole);
      if (pole) return 0.0;
    }
    x = 1.0 - x;
  }
  if (x <= 3.0) {
    double den = x;
    double upper = p1[0] * x;
    for (int i = 1; i <= 5; ++i) {
      den = (den + q1[i - 1]) * x;
      upper = (upper + p1[i]) * x;
    }
    den = (upper + p1[6]) / (den + q1[5]);
    return den * (x - dx0) + aug;
  }
  if (x < xmax1) {
    const double w = 1.0 / (x * x);
    double den = w;
    double upper = p2[0] * w;
    for (int i = 1; i <= 3; ++i) {
      den = (den + q2[i - 1]) * w;
      upper = (upper + p2[i]) * w;
    }
    aug = upper / (den + q2[3]) - 0.5 / x + aug;
  }
  return aug + std::log(x);
}

void XDPSIFN(double x, int n, int kode, int m, double* ans, int* nz, int* ierr) {
  *ierr = 0;
  *nz = 0;
  if (!(x > 0.0) || n < 0 || kode < 1 || kode > 2 || m < 1) {
    *ierr = 1;
    return;
  }
  if (n + m - 1 > kNmax) {
    *ierr = 3;
    return;
  }
  int mm = m;
  const int nxLimit = std::min(-I1MACH(15), I1MACH(16));
  const double r1m5 = D1MACH(5);
  const double r1m4 = D1MACH(4) * 0.5;
  const double wdtol = std::max(r1m4, 0.5e-18);
  // Approximate exponential over- and underflow limit.
  const double elim = 2.302 * (nxLimit * r1m5 - 3.0);
  const double xln = std::log(x);
  double trm[23] = {0.0};
  double trmr[kNmax + 1] = {0.0};
  for (;;) {
    const int nn = n + mm - 1;
    double fn = nn;
    double t = (fn + 1.0) * xln;
    bool underflow = false;
    if (std::fabs(t) > elim) {
      if (t <= 0.0) {
        *nz = 0;
        *ierr = 2;
        return;
      }
      underflow = true;
    } else if (x < wdtol) {
      // Below the unit roundoff the leading term is the whole answer.
      ans[0] = std::pow(x, static_cast<double>(-n - 1));
      for (int k = 1; k < mm; ++k) ans[k] = ans[k - 1] / x;
      if (n == 0 && kode == 2) ans[0] += xln;
      return;
    }
    double xdmy = x, xdmln = xln, xinc = 0.0;
    double tss = 0.0, tt = 0.0, ta = 0.0, tst = 0.0, s = 0.0;
    if (!underflow) {
      // xmin and the number of terms from the decimal precision.
      const double rln = std::min(r1m5 * I1MACH(14), 18.06);
      const double fln = std::max(rln, 3.0) - 3.0;
      const double yint = 3.50 + 0.40 * fln;
      const double slope = 0.21 + fln * (0.0006038 * fln + 0.008677);
      const double xmin = static_cast<int>(yint + slope * fn) + 1;
      if (x < xmin) {
        xinc = xmin - static_cast<int>(x);
        xdmy = x + xinc;
        xdmln = std::log(xdmy);
      }
      t = fn * xdmln;
      const double t1 = xdmln + xdmln;
      const double t2 = t + xdmln;
      if (std::max(std::fabs(t), std::max(std::fabs(t1), std::fabs(t2))) > elim) underflow = true;
    }
    if (underflow) {
      ++*nz;
      ans[mm - 1] = 0.0;
      --mm;
      if (mm == 0) return;
      continue;
    }
    // Asymptotic expansion of w(n+mm-1, xdmy).
    tss = std::exp(-t);
    tt = 0.5 / xdmy;
    double t1 = tt;
    tst = wdtol * tt;
    if (nn != 0) t1 = tt + 1.0 / fn;
    const double rxsq = 1.0 / (xdmy * xdmy);
    ta = 0.5 * rxsq;
    t = (fn + 1.0) * ta;
    s = t * kDpsifnBernoulli[3];
    if (std::fabs(s) >= tst) {
      double tk = 2.0;
      for (int k = 4; k <= 22; ++k) {
        t = t * ((tk + fn + 1.0) / (tk + 1.0)) * ((tk + fn) / (tk + 2.0)) * rxsq;
        trm[k] = t * kDpsifnBernoulli[k];
        if (std::fabs(trm[k]) < tst) break;
        s += trm[k];
        tk += 2.0;
      }
    }
    s = (s + t1) * tss;
    const int nx = static_cast<int>(xinc);
    if (xinc != 0.0) {
      // Backward recurrence w(n, x) = w(n, x + 1) + x^(-n-1) from xdmy to x.
      if (nx > kNmax) {
        *nz = 0;
        *ierr = 3;
        return;
      }
      if (nn != 0) {
        const double np = nn + 1;
        double xm = xinc - 1.0;
        double fx = x + xm;
        // x + xm, not a running sum: accurate when x is small.
        for (int i = 1; i <= nx; ++i) {
          trmr[i] = std::pow(fx, -np);
          s += trmr[i];
          xm -= 1.0;
          fx = x + xm;
        }
      }
    }
    bool orderZero = (nn == 0);
    if (!orderZero) {
      ans[mm - 1] = s;
      // Lower orders reuse the terms of the higher ones.
      for (int j = 2; j <= mm; ++j) {
        fn -= 1.0;
        tss *= xdmy;
        t1 = tt;
        if (fn != 0.0) t1 = tt + 1.0 / fn;
        t = (fn + 1.0) * ta;
        s = t * kDpsifnBernoulli[3];
        if (std::fabs(s) >= tst) {
          double tk = 4.0 + fn;
          for (int k = 4; k <= 22; ++k) {
            trm[k] = trm[k] * (fn + 1.0) / tk;
            if (std::fabs(trm[k]) < tst) break;
            s += trm[k];
            tk += 2.0;
          }
        }
        s = (s + t1) * tss;
        if (xinc != 0.0 && fn != 0.0) {
          double xm = xinc - 1.0;
          double fx = x + xm;
          for (int i = 1; i <= nx; ++i) {
            trmr[i] *= fx;
            s += trmr[i];
            xm -= 1.0;
            fx = x + xm;
          }
        }
        if (fn == 0.0) {
          orderZero = true;
          break;
        }
        ans[mm - j] = s;
      }
      if (!orderZero) return;
    }
    // Order 0: -psi(x) + ln(xdmy), finished by the chosen scaling.
    if (xinc != 0.0) {
      for (int i = 1; i <= nx; ++i) s += 1.0 / (x + (nx - i));
    }
    if (kode == 2) {
      ans[0] = (xdmy == x) ? s : s - std::log(xdmy / x);
    } else {
      ans[0] = s - xdmln;
    }
    return;
  }
}

void mPsiDerivatives(double x, int n, bool scaled, int m, std::vector<double>& out, int& nz) {
  out.assign(m > 0 ? m : 0, 0.0);
  int ierr = 0;
  int zeros = 0;
  XDPSIFN(x, n, scaled ? 2 : 1, m, out.data(), &zeros, &ierr);
  if (ierr == 2) throw std::overflow_error("float overflow");
  nz = zeros;
}

double mPsi(double x) {
  std::vector<double> value;
  int nz = 0;
  mPsiDerivatives(x, 0, false, 1, value, nz);
  return -value[0];
}

}  // namespace qel
