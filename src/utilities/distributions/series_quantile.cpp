// Quantiles in the power-series region of the lower tail (see
// series_quantile.h). The series are
//   gamma: P(a, x) = x^a / Gamma(1 + a) (1 + a S(x)),
//          S(x) = sum_{n>=1} (-x)^n / (n! (a + n))        (DLMF 8.5.1, 8.7.1),
//   beta:  I_x(a, b) = x^a / (a B(a, b)) (1 + a S(x)),
//          S(x) = sum_{n>=1} (1-b)_n x^n / (n! (a + n))   (DLMF 8.17.7),
// both from the term-by-term integration of e^-t or (1 - t)^(b-1).
// ln x = C + c with C = (ln p + ln N)/a in double-double and
// c = -ln(1 + a S(x))/a, a correction of the order of x, found by Newton's
// method in c.
#include "utilities/distributions/series_quantile.h"

#include <cfloat>
#include <cmath>

#include "utilities/elv/precision.h"
#include "utilities/higher_functions/double_double.h"
#include "utilities/higher_functions/incomplete_beta.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace seriesquantile {

namespace {

// Shapes up to kLargestShape use the series: below 1 the general route,
// Newton on tails in double precision, misses 1e-14 by up to a factor 10
// where x is tiny (measured against mpmath). The region is x <= 1/2, where
// the gamma series alternates with a sum within a factor 2 of the sum of
// its terms' sizes, and for the beta law b x <= 10 (the form of betaSeries has
// no cancellation; the bound keeps its number of terms small). Where the
// slope d ln P/d ln x falls below kSmallestSlope a (p near 1 at a large
// b x) the lower tail is ill-conditioned and the general route, on the
// upper tail, keeps more digits; 1 + a S is kept above 1/2 so that
// ln(1 + a S) keeps the relative accuracy of S.
constexpr double kSmallestShape = 1e-5;
constexpr double kLargestShape = 1.0;
constexpr double kLargestArgument = 0.5;
constexpr double kLargestBX = 10.0;
constexpr double kLargestB = 1e15;
// Terms below this, relative to the leading 1 of 1 + a S, no longer count
// (ln x takes S to about 1e-17 absolute).
constexpr double kTermStop = 1e-19;
constexpr int kMaxTerms = 200;
constexpr int kMaxSteps = 20;
constexpr double kLastStep = 1e-13;
constexpr double kSmallestSlope = 0.2;
constexpr double kLnSmallestNormal = -708.39641853226408;

struct SeriesLaw {
  double a, b;
  bool beta;
};

// S(x) and x S'(x) of the gamma law; false when the series does not
// settle. The terms alternate, but for x <= 1/2 their sum is within a factor
// 2 of the sum of their sizes.
bool gammaSeries(double a, double x, double* s, double* xds) {
  double t = 1.0, sum = 0.0, dsum = 0.0;
  for (int n = 1; n <= kMaxTerms; ++n) {
    t *= -x / n;  // (-x)^n / n!
    const double term = t / (a + n);
    sum += term;
    dsum += n * term;
    if (std::fabs(term) * n <= kTermStop) {
      *s = sum;
      *xds = dsum;
      return true;
    }
  }
  return false;
}

// S(x) and x S'(x) of the beta law. The terms (1-b)_n x^n/n! of S would
// alternate and grow to e^(b x) for b > 1; instead
//   1 + a S = (1-x)^b F(a+b, 1; a+1; x)                       (DLMF 8.17.8)
// and, coefficient by coefficient against the binomial series
// (1-x)^-b = sum_n g_n x^n, g_n = (b)_n/n!, F's coefficients
// (a+b)_n/(a+1)_n are g_n + a e_n with e_0 = 0 and
//   e_n = e_(n-1) (a+b+n-1)/(a+n) + g_(n-1) (1-b)/(n (a+n)),
// so that S = (1-x)^b E(x), E = sum e_n x^n, whose terms all have the sign
// of 1 - b: no cancellation for any b x.
bool betaSeries(double a, double b, double x, double* s, double* xds) {
  const double scale = std::exp(b * std::log1p(-x));  // (1-x)^b
  // en = e_n x^n and gn = g_n x^n, carried with their powers of x: g_n
  // alone would overflow for a huge b, g_n x^n stays below e^(b x).
  double en = 0.0, gn = 1.0, sum = 0.0, dsum = 0.0, last = 0.0;
  for (int n = 1; n <= kMaxTerms; ++n) {
    en = x * (en * (a + b + (n - 1)) / (a + n) + gn * (1.0 - b) / (n * (a + n)));
    gn *= x * (b + (n - 1)) / n;
    sum += en;
    dsum += n * en;
    const double term = std::fabs(en);
    if (term <= last && term * scale * n <= kTermStop) {
      *s = scale * sum;
      // x d/dx (1-x)^b = -b x/(1-x) (1-x)^b.
      *xds = scale * (dsum - b * x / (1.0 - x) * sum);
      return true;
    }
    last = term;
  }
  return false;
}

bool series(const SeriesLaw& law, double x, double* s, double* xds) {
  return law.beta ? betaSeries(law.a, law.b, x, s, xds) : gammaSeries(law.a, x, s, xds);
}

bool inRegion(const SeriesLaw& law, double x) {
  return x <= kLargestArgument && (!law.beta || law.b * x <= kLargestBX);
}

// x with ln P = ln p, where ln N is the logarithm of the normalising factor
// (accurate in absolute terms to a few units of 1e-16 a).
bool solve(const SeriesLaw& law, double p, DoubleDouble lnNorm, double* x) {
  const double a = law.a;
  const DoubleDouble big = ddDiv(ddAdd(ddLog(p), lnNorm), DoubleDouble{a, 0.0});
  // |c| stays below about 1 in the region.
  if (big.hi > std::log(kLargestArgument) + 2.0) return false;
  double c = 0.0;
  for (int step = 0;; ++step) {
    if (step == kMaxSteps) return false;
    const double u = big.hi + c;
    if (u < kLnSmallestNormal - 1.0) break;  // x e^-1 below DBL_MIN: S is 0 to double precision
    const double xi = std::exp(u);
    double s = 0.0, xds = 0.0;
    if (!inRegion(law, xi) || !series(law, xi, &s, &xds) || !(a * s > -0.5)) return false;
    // h(c) = c + ln(1 + a S(x))/a with x = e^(C + c); h'(c) = 1 + x S'(x)/(1 + a S).
    // The slope h' is d ln P/d ln x divided by a.
    const double slope = 1.0 + xds / (1.0 + a * s);
    if (!(slope >= kSmallestSlope)) return false;
    const double change = (c + std::log1p(a * s) / a) / slope;
    c -= change;
    // Newton converges quadratically: after a step of 1e-13 the error is
    // far below the rounding noise of c (a few units of 1e-16 |c|), which
    // a smaller bound could wait for in vain.
    if (std::fabs(change) <= kLastStep) break;
  }
  const DoubleDouble lnX = ddAdd(big, c);
  if (lnX.hi < kLnSmallestNormal) {
    *x = 0.0;
    return true;
  }
  int k = 0;
  const DoubleDouble e = ddExp(lnX, &k);
  const double value = std::ldexp(e.hi, k);
  *x = value >= DBL_MIN ? value : 0.0;
  return inRegion(law, *x);
}

bool admissible(double p, double a) {
  return elv::elvPrecision() == elv::ElvPrecision::Full && std::isgreater(a, kSmallestShape) &&
         std::islessequal(a, kLargestShape) && std::isgreaterequal(p, DBL_MIN) &&
         std::isless(p, 1.0);
}

// ln(1 + a/b) in double-double for 0 < a <= 1, 1e-5 < b < 1: the double
// y = ln(1 + a/b) corrected by one Newton step on e^y = q, q = (a + b)/b:
// q e^-y = 1 + t with t about 1e-16, and ln(1 + t) = t to 1e-32.
DoubleDouble lnOnePlusRatio(double a, double b) {
  const DoubleDouble q = ddDiv(ddTwoSum(a, b), DoubleDouble{b, 0.0});
  const double y = std::log1p(a / b);  // at most ln(1 + 1e5)
  int k = 0;
  const DoubleDouble e = ddExp(DoubleDouble{-y, 0.0}, &k);
  const DoubleDouble product = ddMul(q, e);  // q e^-y 2^-k
  const DoubleDouble t =
      ddAdd(DoubleDouble{std::ldexp(product.hi, k), std::ldexp(product.lo, k)}, -1.0);
  return ddAdd(DoubleDouble{y, 0.0}, t.hi);
}

// ln(Gamma(b)/Gamma(a + b)) for 0 < a <= 1, 1e-5 < b: TOMS 708's algdiv from
// b >= 8 on, below by Gamma(b + 1) = b Gamma(b), each step adding
// ln(1 + a/b). Every step from b >= 1 on is at most a, so its rounding is a
// few units of 1e-16 a; the first one, near a/b for b < 1, is carried in
// double-double, as the quantile divides ln N by a.
DoubleDouble lnGammaRatio(double a, double b) {
  DoubleDouble first = {0.0, 0.0};
  if (b < 1.0) {
    first = lnOnePlusRatio(a, b);
    b += 1.0;
  }
  double sum = 0.0;
  for (; b < 8.0; b += 1.0) sum += alnrel(a / b);
  return ddAdd(first, sum + algdiv(a, b));
}

}  // namespace

bool gammaQuantile(double p, double a, double* x) {
  if (!admissible(p, a)) return false;
  return solve(SeriesLaw{a, 0.0, false}, p, DoubleDouble{gamln1(a), 0.0}, x);
}

bool betaQuantile(double p, double a, double b, double* x) {
  if (!admissible(p, a) || !std::isgreater(b, kSmallestShape) || !std::islessequal(b, kLargestB)) {
    return false;
  }
  // ln(a B(a, b)) = ln Gamma(1 + a) + ln(Gamma(b)/Gamma(a + b)).
  return solve(SeriesLaw{a, b, true}, p, ddAdd(lnGammaRatio(a, b), gamln1(a)), x);
}

}  // namespace seriesquantile
}  // namespace qel
