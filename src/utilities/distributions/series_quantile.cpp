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
#include "utilities/special_functions/double_double.h"
#include "utilities/special_functions/incomplete_beta.h"
#include "utilities/special_functions/transcendental.h"

namespace qel {
namespace seriesquantile {

namespace {

// Shapes up to this use the series (above it the quantile's magnification
// of a tail's error, 1/a, is small enough for the general route), and x up
// to kLargestArgument and b x up to kLargestBX: there the terms of S fall
// from the first one on, so S carries no cancellation worse than its size.
constexpr double kSmallestShape = 1e-5;
constexpr double kLargestShape = 1.0;
constexpr double kLargestArgument = 0.5;
constexpr double kLargestBX = 1.0;
constexpr double kLargestB = 1e15;
// Terms below this, relative to the leading 1 of 1 + a S, no longer count
// (ln x takes S to about 1e-17 absolute).
constexpr double kTermStop = 1e-19;
constexpr int kMaxTerms = 200;
constexpr int kMaxSteps = 20;
constexpr double kLnSmallestNormal = -708.39641853226408;

struct SeriesLaw {
  double a, b;
  bool beta;
};

// S(x) and x S'(x); false when the series does not settle.
bool series(const SeriesLaw& law, double x, double* s, double* xds) {
  double t = 1.0, sum = 0.0, dsum = 0.0;
  for (int n = 1; n <= kMaxTerms; ++n) {
    t *= (law.beta ? n - law.b : -1.0) * x / n;  // (1-b)_n x^n / n! or (-x)^n / n!
    const double term = t / (law.a + n);
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

bool inRegion(const SeriesLaw& law, double x) {
  return x <= kLargestArgument && (!law.beta || law.b * x <= kLargestBX);
}

// x with ln P = ln p, where ln N is the logarithm of the normalising factor
// (accurate in absolute terms to a few units of 1e-16 a).
bool solve(const SeriesLaw& law, double p, double lnNorm, double* x) {
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
    if (!inRegion(law, xi) || !series(law, xi, &s, &xds) || !(a * s > -0.75)) return false;
    // h(c) = c + ln(1 + a S(x))/a with x = e^(C + c); h'(c) = 1 + x S'(x)/(1 + a S).
    const double change = (c + std::log1p(a * s) / a) / (1.0 + xds / (1.0 + a * s));
    c -= change;
    if (std::fabs(change) <= 1e-17) break;
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

// ln(Gamma(b)/Gamma(a + b)) for 0 < a <= 1, 1e-5 < b: TOMS 708's algdiv from
// b >= 8 on, below by Gamma(b + 1) = b Gamma(b), each step adding
// ln(1 + a/b), so that the result is accurate in absolute terms to a few
// units of 1e-16 times itself (of the order of a ln b).
double lnGammaRatio(double a, double b) {
  double sum = 0.0;
  for (; b < 8.0; b += 1.0) sum += alnrel(a / b);
  return sum + algdiv(a, b);
}

}  // namespace

bool gammaQuantile(double p, double a, double* x) {
  if (!admissible(p, a)) return false;
  return solve(SeriesLaw{a, 0.0, false}, p, gamln1(a), x);
}

bool betaQuantile(double p, double a, double b, double* x) {
  if (!admissible(p, a) || !std::isgreater(b, kSmallestShape) || !std::islessequal(b, kLargestB)) {
    return false;
  }
  // ln(a B(a, b)) = ln Gamma(1 + a) + ln(Gamma(b)/Gamma(a + b)).
  return solve(SeriesLaw{a, b, true}, p, gamln1(a) + lnGammaRatio(a, b), x);
}

}  // namespace seriesquantile
}  // namespace qel
