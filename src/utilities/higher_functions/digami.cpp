// Derivatives of the incomplete gamma integral I(x, p) = P(p, x) with
// respect to x and to the shape p: algorithm AS 187 (Moore, Applied
// Statistics 31, 1982). A power series below max(1, p), otherwise the
// Legendre continued fraction for the complement, carried with its first and
// second p-derivatives through the three-term (Pearson) recurrences.
#include <cmath>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

namespace {

const double kTolerance = 1.0e-6;
const double kOverflow = 1.0e30;
const double kDenominatorFloor = 1.0e-30;
const int kMaxSteps = 2500;

// A function of p and its first two p-derivatives.
struct Triple {
  double v, d1, d2;
};

// exp(t) as a Triple when t's derivatives are t' = dt, t'' = -ddt.
bool exponentialOf(double t, double dt, double ddt, Triple* out) {
  if (t > MAX_EXPONENT) return false;
  const double e = std::exp(t);
  *out = {e, e * dt, e * (dt * dt - ddt)};
  return true;
}

// Series: I = f S with f = x^p e^-x / Gamma(p + 1), S = sum c_n,
// c_n = x^n / ((p+1)...(p+n)); dc_n/dp = c_n s1_n with s1_n = -sum 1/(p+k),
// d2c_n/dp2 = c_n (s1_n^2 + s2_n) with s2_n = sum 1/(p+k)^2.
bool series(double x, double p, const Triple& f, Triple* result) {
  double c = 1.0, s1 = 0.0, s2 = 0.0;
  double sum = 1.0, sum1 = 0.0, sum2 = 0.0;
  for (int n = 1;; ++n) {
    if (n > kMaxSteps) return false;
    const double pn = p + n;
    c *= x / pn;
    s1 -= 1.0 / pn;
    s2 += 1.0 / (pn * pn);
    const double t0 = c, t1 = c * s1, t2 = c * (s1 * s1 + s2);
    sum += t0;
    sum1 += t1;
    sum2 += t2;
    if (t0 <= kTolerance * sum && std::fabs(t1) <= kTolerance * std::fabs(sum1) &&
        std::fabs(t2) <= kTolerance * std::fabs(sum2)) {
      break;
    }
  }
  *result = {f.v * sum, f.d1 * sum + f.v * sum1, f.d2 * sum + 2.0 * f.d1 * sum1 + f.v * sum2};
  return true;
}

// One sequence of the recurrence X_n = b X_(n-1) + a X_(n-2) with its two
// p-derivatives (b' = -1, a' = n - 1, both second derivatives 0).
struct Recurrence {
  Triple previous, current;
  void step(double a, double da, double b, double db) {
    const Triple next = {
        b * current.v + a * previous.v,
        b * current.d1 + db * current.v + a * previous.d1 + da * previous.v,
        b * current.d2 + 2.0 * db * current.d1 + a * previous.d2 + 2.0 * da * previous.d1};
    previous = current;
    current = next;
  }
  void scale(double factor) {
    for (Triple* t : {&previous, &current}) {
      t->v *= factor;
      t->d1 *= factor;
      t->d2 *= factor;
    }
  }
};

bool settled(double change, double value, double p) {
  return p * std::fabs(change) <= kTolerance && std::fabs(change) <= kTolerance * std::fabs(value);
}

// Continued fraction for R = Gamma(p, x) e^x x^-p:
// 1/(x+1-p-) 1(1-p)/(x+3-p-) 2(2-p)/(x+5-p-) ..., so 1 - I = g R with
// g = x^p e^-x / Gamma(p).
bool continuedFraction(double x, double p, const Triple& g, Triple* result) {
  Recurrence num{{1.0, 0.0, 0.0}, {0.0, 0.0, 0.0}};
  Recurrence den{{0.0, 0.0, 0.0}, {1.0, 0.0, 0.0}};
  Triple r = {0.0, 0.0, 0.0};
  bool haveR = false;
  for (int n = 1;; ++n) {
    if (n > kMaxSteps) return false;
    const double a = (n == 1) ? 1.0 : (n - 1) * (p - (n - 1));
    const double da = (n == 1) ? 0.0 : n - 1;
    const double b = x + 2.0 * n - 1.0 - p;
    num.step(a, da, b, -1.0);
    den.step(a, da, b, -1.0);
    const Triple& A = num.current;
    const Triple& B = den.current;
    if (std::fabs(B.v) >= kDenominatorFloor) {
      const double v = A.v / B.v;
      const double d1 = (A.d1 - v * B.d1) / B.v;
      const double d2 = (A.d2 - 2.0 * d1 * B.d1 - v * B.d2) / B.v;
      const bool done =
          haveR && settled(v - r.v, v, p) && settled(d1 - r.d1, d1, p) && settled(d2 - r.d2, d2, p);
      r = {v, d1, d2};
      haveR = true;
      if (done) break;
    }
    if (std::fabs(A.v) >= kOverflow) {
      num.scale(1.0 / kOverflow);
      den.scale(1.0 / kOverflow);
    }
  }
  *result = {1.0 - g.v * r.v, -(g.d1 * r.v + g.v * r.d1),
             -(g.d2 * r.v + 2.0 * g.d1 * r.d1 + g.v * r.d2)};
  return true;
}

}  // namespace

void DIGAMI(double* d, double x, double p, double gplog, double gp1log, double psip, double psip1,
            double psidp, double psidp1, int* ifault) {
  *ifault = 0;
  for (int i = 0; i < 6; ++i) d[i] = 0.0;
  // I(x, p) and its p-derivatives vanish for x <= 0; p must be positive.
  if (!(x > 0.0) || !(p > 0.0)) return;
  const double lnx = std::log(x);
  const double pdfExponent = -gplog + (p - 1.0) * lnx - x;
  if (pdfExponent > MAX_EXPONENT) {
    *ifault = 1;
    return;
  }
  const double pdf = std::exp(pdfExponent);
  d[0] = pdf;
  d[1] = ((p - 1.0) / x - 1.0) * pdf;
  d[4] = pdf * (lnx - psip);
  Triple result;
  bool ok;
  if (x <= 1.0 || x < p) {
    Triple f;
    ok = exponentialOf(p * lnx - x - gp1log, lnx - psip1, psidp1, &f) && series(x, p, f, &result);
  } else {
    Triple g;
    ok = exponentialOf(p * lnx - x - gplog, lnx - psip, psidp, &g) &&
         continuedFraction(x, p, g, &result);
  }
  if (!ok) {
    *ifault = 1;
    return;
  }
  d[2] = result.d1;
  d[3] = result.d2;
  d[5] = result.v;
}

void mIncompleteGammaDerivatives(double x, double p, std::vector<double>& out) {
  const double gplog = mLogGamma(p);
  const double gp1log = mLogGamma(p + 1.0);
  const double psip = mPsi(p);
  const double psip1 = mPsi(p + 1.0);
  std::vector<double> trigamma;
  int nz = 0;
  mPsiDerivatives(p, 1, false, 1, trigamma, nz);
  const double psidp = trigamma[0];
  mPsiDerivatives(p + 1.0, 1, false, 1, trigamma, nz);
  const double psidp1 = trigamma[0];
  out.assign(6, 0.0);
  int ifault = 0;
  DIGAMI(out.data(), x, p, gplog, gp1log, psip, psip1, psidp, psidp1, &ifault);
  if (ifault == 1) throw std::overflow_error("float overflow");
}

}  // namespace qel
