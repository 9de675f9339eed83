// Regularised incomplete gamma ratio P(a, x): routine GRATIO of ACM TOMS 654
// (DiDonato & Morris 1986) at its first accuracy level (about 14 significant
// digits). Regions: a < 1 (series, erf for a = 1/2, continued fraction);
// 1 <= a < 20 (finite sums for integer and half-integer a, Taylor series,
// continued fraction, asymptotic series); a >= 20 (Temme's uniform expansion
// near x = a, else the same series with a Stirling prefactor).
#include <algorithm>
#include <cmath>
#include <stdexcept>

#include "utilities/higher_functions/transcendental.h"

namespace qel {

namespace {

// Accuracy levels of the published routine; only the first one is used, the
// other two are kept for reference: acc0, big, e00, x00.
const double kAcc0[3] = {5.e-15, 5.e-07, 5.e-04};
const double kBig[3] = {20.0e+00, 14.0e+00, 10.0e+00};
const double kE00[3] = {.25e-03, .25e-01, .14e+00};
const double kX00[3] = {31.0e+00, 17.0e+00, 9.7e+00};
const int kLevel = 0;

const double kAlog10 = 2.30258509299405e+00;
const double kRt2pin = .398942280401433e+00;  // 1/sqrt(2 pi)
const double kRtpi = 1.77245385090552e+00;    // sqrt(pi)
const double kThird = .333333333333333e+00;

// Coefficients of Temme's C_k(z), z^1 first; the z^0 terms are d10 ... d70.
const double kD0[13] = {.833333333333333e-01,  -.148148148148148e-01, .115740740740741e-02,
                        .352733686067019e-03,  -.178755144032922e-03, .391926317852244e-04,
                        -.218544851067999e-05, -.185406221071516e-05, .829671134095309e-06,
                        -.176659527368261e-06, .670785354340150e-08,  .102618097842403e-07,
                        -.438203601845335e-08};
const double kD10 = -.185185185185185e-02;
const double kD1[12] = {-.347222222222222e-02, .264550264550265e-02,  -.990226337448560e-03,
                        .205761316872428e-03,  -.401877572016461e-06, -.180985503344900e-04,
                        .764916091608111e-05,  -.161209008945634e-05, .464712780280743e-08,
                        .137863344691572e-06,  -.575254560351770e-07, .119516285997781e-07};
const double kD20 = .413359788359788e-02;
const double kD2[10] = {-.268132716049383e-02, .771604938271605e-03, .200938786008230e-05,
                        -.107366532263652e-03, .529234488291201e-04, -.127606351886187e-04,
                        .342357873409614e-07,  .137219573090629e-05, -.629899213838006e-06,
                        .142806142060642e-06};
const double kD30 = .649434156378601e-03;
const double kD3[8] = {.229472093621399e-03,  -.469189494395256e-03, .267720632062839e-03,
                       -.756180167188398e-04, -.239650511386730e-06, .110826541153473e-04,
                       -.567495282699160e-05, .142309007324359e-05};
const double kD40 = -.861888290916712e-03;
const double kD4[6] = {.784039221720067e-03, -.299072480303190e-03, -.146384525788434e-05,
                       .664149821546512e-04, -.396836504717943e-04, .113757269706784e-04};
const double kD50 = -.336798553366358e-03;
const double kD5[4] = {-.697281375836586e-04, .277275324495939e-03, -.199325705161888e-03,
                       .679778047793721e-04};
const double kD60 = .531307936463992e-03;
const double kD6[2] = {-.592166437353694e-03, .270878209671804e-03};
const double kD70 = .344367606892378e-03;

// c0 + d[0] z + ... + d[n-1] z^n.
double temmeCoefficient(double c0, const double* d, int n, double z) {
  double s = d[n - 1];
  for (int i = n - 2; i >= 0; --i) s = s * z + d[i];
  return s * z + c0;
}

// Result of one evaluation: P and Q, or the sentinel of an indeterminate case.
struct Ratios {
  double p;
  double q;
  bool indeterminate;
};

Ratios fromP(double p) {
  return {p, 0.5 + (0.5 - p), false};
}
Ratios fromQ(double q) {
  return {0.5 + (0.5 - q), q, false};
}
const Ratios kZero = {0.0, 1.0, false};
const Ratios kOne = {1.0, 0.0, false};
const Ratios kIndeterminate = {2.0, 2.0, true};

// Taylor series for P(a, x)/x^a, a < 1 and x < 1.1.
Ratios smallShapeSeries(double a, double x, double acc) {
  double an = 3.0;
  double c = x;
  double sum = x / (a + 3.0);
  const double tol = 3.0 * acc / (a + 1.0);
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
  if (viaP) return fromP(std::exp(z) * g * (0.5 + (0.5 - j)));
  const double l = rexp(z);
  const double w = 0.5 + (0.5 + l);
  const double q = (w * j - l) * g - h;
  if (q < 0.0) return kOne;
  return fromQ(q);
}

// Continued fraction for Q(a, x)/r, r = x^a e^-x / Gamma(a).
Ratios continuedFraction(double a, double x, double r, double tol) {
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
  } while (std::fabs(an0 - am0) >= tol * an0);
  return fromQ(r * an0);
}

// Q for a >= 1 with 2a an integer, by the finite sums of exp(-x) x^n/n! or of
// erfc and the half-integer terms.
Ratios finiteSum(double a, double x) {
  const int i = static_cast<int>(a + a) / 2;
  double sum, t, c;
  int n;
  if (a == static_cast<double>(i)) {
    sum = std::exp(-x);
    t = sum;
    n = 1;
    c = 0.0;
  } else {
    const double rtx = std::sqrt(x);
    sum = erfc1(0, rtx);
    t = std::exp(-x) / (kRtpi * rtx);
    n = 0;
    c = -0.5;
  }
  while (n != i) {
    ++n;
    c += 1.0;
    t = (x * t) / c;
    sum += t;
  }
  return fromQ(sum);
}

// Taylor series for P/r with the first terms summed last (smallest first).
Ratios taylorSeries(double a, double x, double r, double acc) {
  double wk[20];
  double apn = a + 1.0;
  double t = x / apn;
  wk[0] = t;
  int n = 20;
  for (int k = 2; k <= 20; ++k) {
    apn += 1.0;
    t *= x / apn;
    if (t <= 1.e-3) {
      n = k;
      break;
    }
    wk[k - 1] = t;
  }
  double sum = t;
  const double tol = 0.5 * acc;
  do {
    apn += 1.0;
    t *= x / apn;
    sum += t;
  } while (t > tol);
  for (int m = n - 1; m >= 1; --m) sum += wk[m - 1];
  return fromP((r / a) * (1.0 + sum));
}

// Asymptotic series for Q/r, x >= x0.
Ratios asymptoticSeries(double a, double x, double r, double acc) {
  double wk[20];
  double amn = a - 1.0;
  double t = amn / x;
  wk[0] = t;
  int n = 20;
  for (int k = 2; k <= 20; ++k) {
    amn -= 1.0;
    t *= amn / x;
    if (std::fabs(t) <= 1.e-3) {
      n = k;
      break;
    }
    wk[k - 1] = t;
  }
  double sum = t;
  while (std::fabs(t) > acc) {
    amn -= 1.0;
    t *= amn / x;
    sum += t;
  }
  for (int m = n - 1; m >= 1; --m) sum += wk[m - 1];
  return fromQ((r / x) * (1.0 + sum));
}

// Given r = x^a e^-x / Gamma(a) (or its Stirling form), the series or the
// fraction that suits x.
Ratios fromPrefactor(double a, double x, double r, double acc, double x0, double e) {
  if (r == 0.0) return (x <= a) ? kZero : kOne;
  if (x <= std::max(a, kAlog10)) return taylorSeries(a, x, r, acc);
  if (x < x0) return continuedFraction(a, x, r, std::max(5.0 * e, acc));
  return asymptoticSeries(a, x, r, acc);
}

// Temme's expansion with c = e^-y and w = exp(y) erfc(sqrt y)/2 (or their
// forms at l = 1); full coefficient set unless |s| is small. below: x < a
// (the sign of eta, from the exact difference x - a rather than the rounded
// ratio l = x/a, which is 1 for neighbouring doubles at a beyond 1e16).
Ratios temme(double a, bool below, double z, double c, double w, bool shortForm, double rta) {
  const double u = 1.0 / a;
  z = std::sqrt(z + z);
  if (below) z = -z;
  double c0, c1, c2, c3, c4, c5, c6;
  if (shortForm) {
    c0 = temmeCoefficient(-kThird, kD0, 7, z);
    c1 = temmeCoefficient(kD10, kD1, 6, z);
    c2 = temmeCoefficient(kD20, kD2, 5, z);
    c3 = temmeCoefficient(kD30, kD3, 4, z);
    c4 = temmeCoefficient(kD40, kD4, 2, z);
    c5 = temmeCoefficient(kD50, kD5, 2, z);
    c6 = temmeCoefficient(kD60, kD6, 1, z);
  } else {
    c0 = temmeCoefficient(-kThird, kD0, 13, z);
    c1 = temmeCoefficient(kD10, kD1, 12, z);
    c2 = temmeCoefficient(kD20, kD2, 10, z);
    c3 = temmeCoefficient(kD30, kD3, 8, z);
    c4 = temmeCoefficient(kD40, kD4, 6, z);
    c5 = temmeCoefficient(kD50, kD5, 4, z);
    c6 = temmeCoefficient(kD60, kD6, 2, z);
  }
  const double t = ((((((kD70 * u + c6) * u + c5) * u + c4) * u + c3) * u + c2) * u + c1) * u + c0;
  if (!below) return fromQ(c * (w + kRt2pin * t / rta));
  return fromP(c * (w - kRt2pin * t / rta));
}

// rlog(1 + d) = d - ln(1 + d) to a few units in the last place: with
// v = d/(2 + d), ln(1 + d) = 2 atanh v, so rlog = d v - 2 (v^3/3 + v^5/5 + ...)
// (the form of Loader's deviance bd0). y = a rlog enters exp(-y), whose
// relative error is y times that of rlog.
double rlogOfDifference(double d) {
  if (!(std::fabs(d) <= 0.5)) return rlog1(d);
  const double v = d / (2.0 + d);
  const double v2 = v * v;
  double term = 2.0 * v * v2;
  double sum = 0.0;
  for (int j = 3; j < 200; j += 2) {
    const double next = sum + term / j;
    if (next == sum) break;
    sum = next;
    term *= v2;
  }
  return d * v - sum;
}

// GRATIO answers "indeterminate" where a e^2 > 3.28e-3 (a beyond 6.7e28)
// near x = a, because it forms l = x/a, which has lost the digits of x - a
// there; mIncompleteGamma keeps that answer (written). With exactNearA,
// eta comes from the exact difference x - a (rlogOfDifference), so exp(-y)
// and erfc(sqrt y) are evaluated in full at every a; the Taylor forms of
// the window |s| <= e0/sqrt(a) serve only the shapes GRATIO allows.
Ratios largeShape(double a, double x, double acc, double e0, double x0, double e,
                  bool exactNearA = false) {
  const double l = x / a;
  if (l == 0.0) return kZero;
  const double s = 0.5 + (0.5 - l);
  const bool below = x < a;
  const bool beyondGratio = a * e * e > 3.28e-3;
  if (beyondGratio && !exactNearA && std::fabs(s) <= 2.0 * e) return kIndeterminate;
  // rlog(l) from l - 1 = (x - a)/a: the difference x - a is exact near
  // l = 1, where the rounded l would cost rlog its relative accuracy.
  const double z = rlogOfDifference((x - a) / a);
  if (z >= 700.0 / a) return below ? kZero : kOne;
  const double y = a * z;
  const double rta = std::sqrt(a);
  if (std::fabs(s) <= e0 / rta && !beyondGratio) {
    // Near l = 1: exp(-y) and exp(y) erfc(sqrt y) by their Taylor forms.
    const double c = 0.5 + (0.5 - y);
    const double w = (0.5 - std::sqrt(y) * (0.5 + (0.5 - y / 3.0)) / kRtpi) / c;
    return temme(a, below, z, c, w, true, rta);
  }
  if (std::fabs(s) <= 0.4) {
    const double c = std::exp(-y);
    const double w = 0.5 * erfc1(1, std::sqrt(y));
    return temme(a, below, z, c, w, std::fabs(s) <= 1.e-3, rta);
  }
  // Stirling's series for Gamma(a) in the prefactor.
  const double t = (1.0 / a) * (1.0 / a);
  const double t1 = (((0.75 * t - 1.0) * t + 3.5) * t - 105.0) / (a * 1260.0) - y;
  return fromPrefactor(a, x, kRt2pin * rta * std::exp(t1), acc, x0, e);
}

Ratios gratio(double a, double x) {
  const double e = spmpar(1);
  if (a * x == 0.0) return (x <= a) ? kZero : kOne;
  const double acc = std::max(kAcc0[kLevel], e);
  const double e0 = kE00[kLevel];
  const double x0 = kX00[kLevel];
  if (a < 1.0) {
    if (a == 0.5) {
      if (x < 0.25) return fromP(erf(std::sqrt(x)));
      return fromQ(erfc1(0, std::sqrt(x)));
    }
    if (x < 1.1) return smallShapeSeries(a, x, acc);
    const double u = a * std::exp(a * std::log(x) - x);
    if (u == 0.0) return kOne;
    return continuedFraction(a, x, u * (1.0 + gam1(a)), std::max(5.0 * e, acc));
  }
  if (a >= kBig[kLevel]) return largeShape(a, x, acc, e0, x0, e);
  if (a <= x && x < x0) {
    const double twoA = a + a;
    if (twoA == static_cast<double>(static_cast<int>(twoA))) return finiteSum(a, x);
  }
  const double r = std::exp(a * std::log(x) - x) / XGAMMA(a);
  return fromPrefactor(a, x, r, acc, x0, e);
}

}  // namespace

bool smallShapeGammaRatios(double a, double x, double* p, double* q) {
  if (a == 0.5 && x > 0.0 && !std::isinf(x)) {
    // P(1/2, x) = erf(sqrt x), Q(1/2, x) = erfc(sqrt x).
    const double rt = std::sqrt(x);
    const Ratios r = x < 0.25 ? fromP(erf(rt)) : fromQ(erfc1(0, rt));
    *p = r.p;
    *q = r.q;
    return true;
  }
  if (!(a > 0.0 && a < 1.0 && x > 0.0 && x < 1.1)) return false;
  // The series is run to the rounding level, not GRATIO's 5e-15.
  const Ratios r = smallShapeSeries(a, x, spmpar(1));
  *p = r.p;
  *q = r.q;
  return true;
}

// GRATIO takes the expansion from a = 20 out to |1 - x/a| = 0.4. Measured
// against mpmath, its truncations (the coefficient polynomials in z, the
// powers of 1/a up to the seventh) leave relative errors near 1e-13 at
// |1 - x/a| = 0.4 and 2e-14 at a = 20 within 0.2; from a = 40 within 0.25
// they stay below 3e-15.
constexpr double kTemmeReach = 0.25;
constexpr double kTemmeSmallestShape = 40.0;

bool temmeGammaRatios(double a, double x, double* p, double* q) {
  if (!(a >= kTemmeSmallestShape) || !(x > 0.0) || std::isinf(a) || std::isinf(x)) return false;
  const double s = 0.5 + (0.5 - x / a);
  if (!(std::fabs(s) <= kTemmeReach)) return false;
  const Ratios r = largeShape(a, x, std::max(kAcc0[kLevel], spmpar(1)), kE00[kLevel], kX00[kLevel],
                              spmpar(1), true);
  if (r.indeterminate) return false;
  *p = r.p;
  *q = r.q;
  return true;
}

double mIncompleteGamma(double dX, double dP) {
  if (dP < 0.0) throw std::invalid_argument("dP < 0");
  if (dX < 0.0) throw std::invalid_argument("dX < 0");
  if (dX == 0.0 && dP == 0.0) throw std::invalid_argument("dX and dP both 0");
  if (std::isnan(dX) || std::isnan(dP)) return dX + dP;
  const Ratios result = gratio(dP, dX);
  if (result.indeterminate) throw std::runtime_error("no convergence");
  return result.p;
}

}  // namespace qel
