// Expansions of the incomplete beta ratio (ACM TOMS 708, DiDonato & Morris
// 1992): the continued fraction bfrac, the asymptotic expansion bgrat for
// a much larger than b (with grat1, the incomplete gamma ratio for a <= 1
// that it rests on) and the asymptotic expansion basym for a and b both large.
#include <algorithm>
#include <cmath>

#include "utilities/higher_functions/incomplete_beta.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

double bfrac(double a, double b, double x, double y, double lambda, double eps) {
  const double prefix = brcomp(a, b, x, y);
  if (prefix == 0.0) return 0.0;
  const double c = 1.0 + lambda;
  const double c0 = b / a;
  const double c1 = 1.0 + 1.0 / a;
  const double yp1 = y + 1.0;
  double n = 0.0, p = 1.0, s = a + 1.0;
  double an = 0.0, bn = 1.0, anp1 = 1.0, bnp1 = c / c1;
  double r = c1 / c;
  for (;;) {
    n += 1.0;
    double t = n / a;
    const double w = n * (b - n) * x;
    double e = a / s;
    const double alpha = (p * (p + c0) * e * e) * (w * x);
    e = (1.0 + t) / (c1 + t + t);
    const double beta = n + w / s + e * (c + n * yp1);
    p = 1.0 + t;
    s += 2.0;
    // Three-term recurrence of the numerators and denominators.
    t = alpha * an + beta * anp1;
    an = anp1;
    anp1 = t;
    t = alpha * bn + beta * bnp1;
    bn = bnp1;
    bnp1 = t;
    const double r0 = r;
    r = anp1 / bnp1;
    if (std::fabs(r - r0) <= eps * r) break;
    // Rescale so that the recurrence stays in range.
    an /= bnp1;
    bn /= bnp1;
    anp1 = r;
    bnp1 = 1.0;
  }
  return prefix * r;
}

void grat1(double a, double x, double r, double* p, double* q, double eps) {
  if (a * x == 0.0) {
    if (x <= a) {
      *p = 0.0;
      *q = 1.0;
    } else {
      *p = 1.0;
      *q = 0.0;
    }
    return;
  }
  if (a == 0.5) {
    if (x < 0.25) {
      *p = erf(std::sqrt(x));
      *q = 0.5 + (0.5 - *p);
    } else {
      *q = erfc1(0, std::sqrt(x));
      *p = 0.5 + (0.5 - *q);
    }
    return;
  }
  if (x < 1.1) {
    // Taylor series for P(a, x)/x^a.
    double an = 3.0;
    double c = x;
    double sum = x / (a + 3.0);
    const double tol = 0.1 * eps / (a + 1.0);
    double t;
    do {
      an += 1.0;
      c = -c * (x / an);
      t = c / (a + an);
      sum += t;
    } while (std::fabs(t) > tol);
    const double j = a * x * ((sum / 6.0 - 0.5 / (a + 2.0)) * x + 1.0 / (a + 1.0));
    const double z = a * std::log(x);
    const double h = gam1(a);
    const double g = 1.0 + h;
    const bool viaP = (x < 0.25) ? !(z > -.13394) : !(a < x / 2.59);
    if (viaP) {
      *p = std::exp(z) * g * (0.5 + (0.5 - j));
      *q = 0.5 + (0.5 - *p);
      return;
    }
    const double l = rexp(z);
    const double w = 0.5 + (0.5 + l);
    *q = (w * j - l) * g - h;
    if (*q < 0.0) {
      *p = 1.0;
      *q = 0.0;
      return;
    }
    *p = 0.5 + (0.5 - *q);
    return;
  }
  // Continued fraction for Q(a, x)/r.
  double a2nm1 = 1.0, a2n = 1.0;
  double b2nm1 = x, b2n = x + (1.0 - a);
  double c = 1.0;
  double am0, an0;
  do {
    a2nm1 = x * a2n + c * a2nm1;
    b2nm1 = x * b2n + c * b2nm1;
    am0 = a2nm1 / b2nm1;
    c += 1.0;
    const double cma = c - a;
    a2n = a2nm1 + cma * a2n;
    b2n = b2nm1 + cma * b2n;
    an0 = a2n / b2n;
  } while (std::fabs(an0 - am0) >= 4.0 * eps * an0);
  *q = r * an0;
  *p = 0.5 + (0.5 - *q);
}

void bgrat(double a, double b, double x, double y, double* w, double eps, int* ierr) {
  const int kTerms = 30;
  double c[kTerms + 1], d[kTerms + 1];
  const double bm1 = (b - 0.5) - 0.5;
  const double nu = a + 0.5 * bm1;
  const double lnx = (y > 0.375) ? std::log(x) : alnrel(-y);
  const double z = -nu * lnx;
  *ierr = 1;
  if (b * z == 0.0) return;
  // r = exp(-z) z^b / Gamma(b), u = exp(-z) z^b Gamma(a+b) / (Gamma(a) Gamma(b) nu^b).
  double r = b * (1.0 + gam1(b)) * std::exp(b * std::log(z));
  r = r * std::exp(a * lnx) * std::exp(0.5 * bm1 * lnx);
  double u = algdiv(b, a) + b * std::log(nu);
  u = r * std::exp(-u);
  if (u == 0.0) return;
  double p, q;
  grat1(b, z, r, &p, &q, eps);
  const double v = 0.25 * (1.0 / nu) * (1.0 / nu);
  const double t2 = 0.25 * lnx * lnx;
  const double l = *w / u;
  double j = q / r;
  double sum = j;
  double t = 1.0;
  double cn = 1.0;
  double n2 = 0.0;
  for (int n = 1; n <= kTerms; ++n) {
    const double bp2n = b + n2;
    j = (bp2n * (bp2n + 1.0) * j + (z + bp2n + 1.0) * t) * v;
    n2 += 2.0;
    t *= t2;
    cn /= n2 * (n2 + 1.0);
    c[n] = cn;
    double s = 0.0;
    double coef = b - n;
    for (int i = 1; i <= n - 1; ++i) {
      s += coef * c[i] * d[n - i];
      coef += b;
    }
    d[n] = bm1 * cn + s / n;
    const double dj = d[n] * j;
    sum += dj;
    if (sum <= 0.0) return;
    if (std::fabs(dj) <= eps * (sum + l)) break;
  }
  *ierr = 0;
  *w += u * sum;
}

double basym(double a, double b, double lambda, double eps) {
  const int num = 20;
  const double e0 = 1.12837916709551e+00;  // 2/sqrt(pi)
  const double e1 = .353553390593274e+00;  // 2^(-3/2)
  double a0[num + 2], b0[num + 2], c[num + 2], d[num + 2];
  double h, r0, r1, w0;
  if (a < b) {
    h = a / b;
    r0 = 1.0 / (1.0 + h);
    r1 = (b - a) / b;
    w0 = 1.0 / std::sqrt(a * (1.0 + h));
  } else {
    h = b / a;
    r0 = 1.0 / (1.0 + h);
    r1 = (b - a) / a;
    w0 = 1.0 / std::sqrt(b * (1.0 + h));
  }
  const double f = a * rlog1(-lambda / a) + b * rlog1(lambda / b);
  const double t = std::exp(-f);
  if (t == 0.0) return 0.0;
  const double z0 = std::sqrt(f);
  const double z = 0.5 * (z0 / e1);
  const double z2 = f + f;
  a0[1] = (2.0 / 3.0) * r1;
  c[1] = -0.5 * a0[1];
  d[1] = -c[1];
  double j0 = (0.5 / e0) * erfc1(1, z0);
  double j1 = e1;
  double sum = j0 + d[1] * w0 * j1;
  double s = 1.0;
  const double h2 = h * h;
  double hn = 1.0;
  double w = w0;
  double znm1 = z;
  double zn = z2;
  for (int n = 2; n <= num; n += 2) {
    hn *= h2;
    a0[n] = 2.0 * r0 * (1.0 + h * hn) / (n + 2.0);
    const int np1 = n + 1;
    s += hn;
    a0[np1] = 2.0 * r1 * s / (n + 3.0);
    for (int i = n; i <= np1; ++i) {
      const double r = -0.5 * (i + 1.0);
      b0[1] = r * a0[1];
      for (int m = 2; m <= i; ++m) {
        double bsum = 0.0;
        for (int jj = 1; jj <= m - 1; ++jj) bsum += (jj * r - (m - jj)) * a0[jj] * b0[m - jj];
        b0[m] = r * a0[m] + bsum / m;
      }
      c[i] = b0[i] / (i + 1.0);
      double dsum = 0.0;
      for (int jj = 1; jj <= i - 1; ++jj) dsum += d[i - jj] * c[jj];
      d[i] = -(dsum + c[i]);
    }
    j0 = e1 * znm1 + (n - 1.0) * j0;
    j1 = e1 * zn + n * j1;
    znm1 *= z2;
    zn *= z2;
    w *= w0;
    const double t0 = d[n] * w * j0;
    w *= w0;
    const double t1 = d[np1] * w * j1;
    sum += t0 + t1;
    if (std::fabs(t0) + std::fabs(t1) <= eps * sum) break;
  }
  const double u = std::exp(-bcorr(a, b));
  return e0 * t * u * sum;
}

}  // namespace qel
