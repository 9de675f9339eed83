// Log-gamma and its relatives.
// - XGAMMA, XGAMMLN, mLogGamma, mGamma: the Lanczos form with g = 7 and nine
//   coefficients (about 15 significant digits for positive arguments).
// - gamln, gamln1, gam1, rlog1, rexp: the rational approximations of ACM
//   TOMS 708 (DiDonato & Morris 1992), coefficients as published.
// - rlog: x - 1 - ln x for the incomplete gamma ratio of ACM TOMS 654, on the
//   same rational approximation as rlog1 (rlog(x) = rlog1(x - 1)).
#include <cmath>
#include <stdexcept>

#include "utilities/higher_functions/transcendental.h"

namespace qel {

namespace {

const double kLanczos[9] = {0.9999999999995183,  676.5203681218835,     -1259.139216722289,
                            771.3234287757674,   -176.6150291498386,    12.50734324009056,
                            -0.1385710331296526, 9.934937113930748e-06, 1.659470187408462e-07};
const double kHalfLog2Pi = 0.9189385332046727;

// Horner evaluation of c[0] + c[1] t + ... + c[n-1] t^(n-1).
double polynomial(const double* c, int n, double t) {
  double s = c[n - 1];
  for (int i = n - 2; i >= 0; --i) s = s * t + c[i];
  return s;
}

// Shared rational part of rlog and rlog1: 2t(1/(1-r) - r w) with r = h/(h+2).
double rlogCore(double h, double w1) {
  const double p0 = .333333333333333e+00, p1 = -.224696413112536e+00, p2 = .620886815375787e-02;
  const double q1 = -.127408923933623e+01, q2 = .354508718369557e+00;
  const double r = h / (h + 2.0);
  const double t = r * r;
  const double w = ((p2 * t + p1) * t + p0) / ((q2 * t + q1) * t + 1.0);
  return 2.0 * t * (1.0 / (1.0 - r) - r * w) + w1;
}

// rlog1 at the centres -0.3 and 1/3 of its outer intervals.
const double kRlogA = .566749439387324e-01;  // -0.3 - ln 0.7
const double kRlogB = .456512608815524e-01;  // 1/3 - ln(4/3)

}  // namespace

double XGAMMLN(double x) {
  if (x == 1.0 || x == 2.0) return 0.0;
  double s = kLanczos[0];
  for (int j = 1; j <= 8; ++j) s += kLanczos[j] / (x + (j - 1));
  const double t = x + 6.5;
  return std::log(s) + kHalfLog2Pi - t + (x - 0.5) * std::log(t);
}

double XGAMMA(double x) {
  if (x == 1.0 || x == 2.0) return 1.0;
  return std::exp(XGAMMLN(x));
}

double mLogGamma(double x) {
  if (x <= 0.0) throw std::invalid_argument("gamma of a nonpositive argument");
  if (x == 1.0 || x == 2.0) return 0.0;
  double tmp = x + 7.0;
  // Below about 1e-15 the argument is lost against 7 in the sum.
  if (!(tmp > 7.0)) throw std::invalid_argument("gamma of a value too close to 0");
  double s = 0.0;
  for (int j = 8; j >= 1; --j) {
    s += kLanczos[j] / tmp;
    tmp -= 1.0;
  }
  s += kLanczos[0];
  const double t = x + 6.5;
  return mLog(s, true) + kHalfLog2Pi - t + (x - 0.5) * mLog(t, true);
}

double mGamma(double x, bool throwOnError) {
  return mExponential(mLogGamma(x), throwOnError);
}

double gam1(double a) {
  static const double p[7] = {.577215664901533e+00, -.409078193005776e+00, -.230975380857675e+00,
                              .597275330452234e-01, .766968181649490e-02,  -.514889771323592e-02,
                              .589597428611429e-03};
  static const double q[5] = {.100000000000000e+01, .427569613095214e+00, .158451672430138e+00,
                              .261132021441447e-01, .423244297896961e-02};
  static const double r[9] = {-.422784335098468e+00, -.771330383816272e+00, -.244757765222226e+00,
                              .118378989872749e+00,  .930357293360349e-03,  -.118290993445146e-01,
                              .223047661158249e-02,  .266505979058923e-03,  -.132674909766242e-03};
  const double s1 = .273076135303957e+00, s2 = .559398236957378e-01;
  // t is a or a - 1, whichever lies in [-0.5, 0.5].
  double t = a;
  const double d = a - 0.5;
  if (d > 0.0) t = d - 0.5;
  if (t == 0.0) return 0.0;
  if (t > 0.0) {
    const double w = polynomial(p, 7, t) / polynomial(q, 5, t);
    if (d <= 0.0) return a * w;
    return (t / a) * ((w - 0.5) - 0.5);
  }
  const double w = polynomial(r, 9, t) / ((s2 * t + s1) * t + 1.0);
  if (d <= 0.0) return a * ((w + 0.5) + 0.5);
  return t * w / a;
}

double gamln1(double a) {
  static const double p[7] = {.577215664901533e+00,  .844203922187225e+00,  -.168860593646662e+00,
                              -.780427615533591e+00, -.402055799310489e+00, -.673562214325671e-01,
                              -.271935708322958e-02};
  // Denominators with the leading 1 written out.
  static const double q[7] = {1.0,
                              .288743195473681e+01,
                              .312755088914843e+01,
                              .156875193295039e+01,
                              .361951990101499e+00,
                              .325038868253937e-01,
                              .667465618796164e-03};
  static const double r[6] = {.422784335098467e+00, .848044614534529e+00, .565221050691933e+00,
                              .156513060486551e+00, .170502484022650e-01, .497958207639485e-03};
  static const double s[6] = {1.0,
                              .124313399877507e+01,
                              .548042109832463e+00,
                              .101552187439830e+00,
                              .713309612391000e-02,
                              .116165475989616e-03};
  if (a < 0.6) return -a * (polynomial(p, 7, a) / polynomial(q, 7, a));
  const double x = (a - 0.5) - 0.5;
  return x * (polynomial(r, 6, x) / polynomial(s, 6, x));
}

double gamln(double a) {
  static const double c[6] = {.833333333333333e-01,  -.277777777760991e-02, .793650666825390e-03,
                              -.595202931351870e-03, .837308034031215e-03,  -.165322962780713e-02};
  const double d = .418938533204673e+00;  // (ln(2 pi) - 1)/2
  if (a <= 0.8) return gamln1(a) - std::log(a);
  if (a <= 2.25) return gamln1((a - 0.5) - 0.5);
  if (a < 10.0) {
    // Down to (1.25, 2.25] by Gamma(t + 1) = t Gamma(t).
    const int n = static_cast<int>(a - 1.25);
    double t = a;
    double w = 1.0;
    for (int i = 1; i <= n; ++i) {
      t -= 1.0;
      w *= t;
    }
    return gamln1(t - 1.0) + std::log(w);
  }
  const double t = (1.0 / a) * (1.0 / a);
  const double w = polynomial(c, 6, t) / a;
  return (d + w) + (a - 0.5) * (std::log(a) - 1.0);
}

double rlog(double x) {
  if (x < 0.61 || x > 1.57) return ((x - 0.5) - 0.5) - std::log(x);
  if (x < 0.82) return rlogCore((x - 0.7) / 0.7, kRlogA - ((x - 0.7) / 0.7) * 0.3);
  if (x > 1.18) return rlogCore(0.75 * x - 1.0, kRlogB + (0.75 * x - 1.0) / 3.0);
  return rlogCore((x - 0.5) - 0.5, 0.0);
}

double rlog1(double x) {
  if (x < -0.39 || x > 0.57) return x - std::log((x + 0.5) + 0.5);
  if (x < -0.18) {
    const double h = (x + 0.3) / 0.7;
    return rlogCore(h, kRlogA - h * 0.3);
  }
  if (x > 0.18) {
    const double h = 0.75 * x - 0.25;
    return rlogCore(h, kRlogB + h / 3.0);
  }
  return rlogCore(x, 0.0);
}

double rexp(double x) {
  const double p1 = .914041914819518e-09, p2 = .238082361044469e-01;
  const double q1 = -.499999999085958e+00, q2 = .107141568980644e+00, q3 = -.119041179760821e-01,
               q4 = .595130811860248e-03;
  if (std::fabs(x) <= 0.15) {
    return x * (((p2 * x + p1) * x + 1.0) / ((((q4 * x + q3) * x + q2) * x + q1) * x + 1.0));
  }
  const double w = std::exp(x);
  if (x > 0.0) return w * (0.5 + (0.5 - 1.0 / w));
  return (w - 0.5) - 0.5;
}

}  // namespace qel
