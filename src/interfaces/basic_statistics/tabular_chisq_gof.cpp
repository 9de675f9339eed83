// Pearson's chi-square goodness-of-fit test on a table of category counts.
#include <qel/distributions.h>
#include <qel/elv.h>
#include <qel/tabular_gof.h>

#include <cmath>
#include <limits>

#include "interfaces/basic_statistics/utilities.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace {

// x^a e^-x / Gamma(a + 1) for x, a > 0, as exp(-a rlog(x/a)) / Gamma*(a)
// with rlog(t) = t - 1 - ln t and ln Gamma*(a) = ln(Gamma(a + 1) (e/a)^a):
// the large terms a ln x - x - ln Gamma(a + 1) cancel analytically, not in
// floating point (DiDonato and Morris, ACM TOMS 12 (1986) 377).
double gammaPrefactor(double a, double x) {
  const double exponent = -a * rlog(x / a) - ln_scaled_gamma(a);
  return exponent < -745.0 ? 0.0 : std::exp(exponent);
}

// Q(a, x), the regularised upper incomplete gamma function: the continued
// fraction of Legendre by the modified Lentz method for x > a + 1, else
// 1 - P(a, x) from the power series of P (Press et al., Numerical Recipes,
// 3rd ed., 6.2). The prefactor keeps the relative accuracy of Q down to
// the underflow threshold, which the chi-square kernel loses below 1e-290.
double upperIncompleteGamma(double a, double x) {
  const double prefactor = gammaPrefactor(a, x);
  if (x > a + 1.0) {
    const double tiny = 1e-300;
    double b = x + 1.0 - a, c = 1.0 / tiny, d = 1.0 / b, h = d;
    for (int i = 1; i < 100000; ++i) {
      const double an = -i * (i - a);
      b += 2.0;
      d = an * d + b;
      if (std::fabs(d) < tiny) d = tiny;
      c = b + an / c;
      if (std::fabs(c) < tiny) c = tiny;
      d = 1.0 / d;
      const double delta = d * c;
      h *= delta;
      if (std::fabs(delta - 1.0) < 1e-16) break;
    }
    return a * prefactor * h;  // x^a e^-x / Gamma(a) times the fraction
  }
  double term = 1.0, series = 1.0;
  for (int n = 1; n < 1000000; ++n) {
    term *= x / (a + n);
    series += term;
    if (term < series * 1e-17) break;
  }
  return 1.0 - prefactor * series;
}

// The chi-square upper tail P(X >= x) for df > 0 and finite x > 0.
double chiSquareUpperTail(double x, double df) {
  return upperIncompleteGamma(0.5 * df, 0.5 * x);
}

}  // namespace

int RunLynTabularChiSqGOFTest(double const* observed, double const* proportions, double* expected,
                              double* contributions, double* statistic, double* pValue,
                              double* degreesOfFreedom, double total, unsigned k) {
  const double equalShare = k > 0 ? total / static_cast<double>(k) : 0.0;
  // Kahan's sum carries the statistic; the plain sum runs beside it only to
  // notice an infinite term, whose carry (inf - inf) would turn the
  // compensated sum into NaN.
  v1::CompensatedSum compensated;
  double plain = 0.0;
  for (unsigned i = 0; i < k; ++i) {
    const double count = observed[i];
    const double e = proportions ? proportions[i] * total : equalShare;
    const double d = count - e;
    const double contribution = d * (d / e);
    expected[i] = e;
    contributions[i] = contribution;
    compensated.add(contribution);
    plain += contribution;
  }
  const double x = std::isfinite(plain) ? compensated.sum : plain;
  const double df = static_cast<double>(k) - 1.0;
  *statistic = x;
  *degreesOfFreedom = df;
  // The exported cumulative function runs armed, where a NaN argument traps:
  // the undefined cases are answered here.
  if (k == 0 || std::isnan(x)) {
    *pValue = std::numeric_limits<double>::quiet_NaN();
  } else if (std::isinf(x)) {
    *pValue = x > 0.0 ? 0.0 : 1.0;
  } else if (x > 0.0 && df > 0.0) {
    *pValue = chiSquareUpperTail(x, df);
  } else {
    // A statistic of 0 or below, and 0 degrees of freedom: the kernel's
    // answer.
    *pValue = ChiSqCdf(x, df, 0.0, true);
  }
  return 0;
}

}  // namespace qel
