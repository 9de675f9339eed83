// Far lower tail of the noncentral t for a small integer df m, by an
// expansion in powers of c = m/(m + t^2).
//
// For x < 0 the density of T = (Z + delta)/sqrt(V/m) is a constant times
// c^((m+1)/2) e^(-delta^2 c/2) M_m(-delta sqrt(1-c)), with
// M_m(y) = integral_0^inf u^m e^(-(u-y)^2/2) du. For integer m, M_m is a
// polynomial times e^(-y^2/2) plus a polynomial times Phi(y), and expanding
// the product in powers of c gives terms
//   c^((m+1)/2 + j) [P_j(delta) phi(delta) + R_j(delta) Q(delta)],
// Q the upper normal tail. Each power of c integrates from -inf to t in
// closed form:
//   A(j) = integral_-inf^t c(x)^((m+1)/2 + j) dx,
//   A(0) = B sqrt(m) (central t lower tail),  B = Beta(1/2, m/2),
//   A(j) = (t c^((m+2j-1)/2) + (m+2j-2) A(j-1)) / (m+2j-1),
// the recursion coming from d/dx [x c^p] = (1-2p) c^p + 2p c^(p+1). Four
// terms are kept, so the truncation error is of relative order c^4.
// The polynomials (tools/reference/derive_t_expansion.py) are stored as
// integers with one scale factor per m; the scale carries sqrt(2/pi) for
// even m, where no integer form exists under the common factor alone.
//
// The expansion suits |t| large against sqrt(m). For large delta the two
// parts P phi and R Q cancel (the tail is far below either part), so its
// relative accuracy falls with delta.
#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"

namespace {

using namespace qel::elv;

#include "utilities/elv/t_expansion_table.inc"

constexpr char kName[] = "t_ncdf";
constexpr double kSqrtTwoPi = 2.5066282746310007;
// Beyond this |delta| the degree-18 polynomials could overflow; the
// noncentral t never comes near it (its L = delta^2/2 is capped far below).
constexpr double kMaxDelta = 1e6;

double horner(const double* coefficients, double x) {
  double sum = 0.0;
  for (int k = kExpansionDegree; k >= 0; --k) sum = sum * x + coefficients[k];
  return sum;
}

// c = m/(m + t^2) without overflowing t^2 for huge |t| (c then underflows
// towards 0, which the powers below take as it comes).
double powerBase(double t, double m) {
  const double magnitude = std::fabs(t);
  if (magnitude > 1e100) return (m / magnitude) / magnitude;
  return m / (m + t * t);
}

double fail() {
  ELVexit(kName, 4, 'F');
  return -1.0;
}

}  // namespace

extern "C" {

double t_expansion_approx(double t, double df, double delta) {
  // A NaN argument or a delta beyond the polynomials' range fails like an
  // m outside the table.
  if (anyNan(t, df, delta) || !(df >= 1.0 && df < 13.0) || !(std::fabs(delta) < kMaxDelta)) {
    return fail();
  }
  const int m = static_cast<int>(df);
  const double halfM = 0.5 * m;
  const double lnB = ln_gamma(0.5) + ln_gamma(halfM) - ln_gamma(halfM + 0.5);
  if (lnB >= kOverflowLog) return fail();
  const double B = std::exp(lnB);
  const double rootM = std::sqrt(static_cast<double>(m));

  double tLower = 0.0, tUpper = 0.0;
  t_df(t, df, &tLower, &tUpper);
  const double c = powerBase(t, m);
  double A[kExpansionTerms];
  A[0] = B * rootM * tLower;
  for (int j = 1; j < kExpansionTerms; ++j) {
    const double n = m + 2.0 * j - 1.0;
    // An underflowed power (|t| near the largest double) must not meet an
    // infinite t.
    const double power = std::pow(c, 0.5 * n);
    A[j] = ((power == 0.0 ? 0.0 : t * power) + (n - 1.0) * A[j - 1]) / n;
  }

  double pLower = 0.0, q = 0.0;
  normal_df(delta, &pLower, &q);
  const double density = phi(delta);
  const ExpansionEntry& entry = kExpansionTable[m - 1];
  double sum = 0.0;
  for (int j = 0; j < kExpansionTerms; ++j) {
    // A part whose normal factor underflowed adds nothing.
    double term = 0.0;
    if (density != 0.0) term += horner(entry.phiPoly[j], delta) * density;
    if (q != 0.0) term += horner(entry.tailPoly[j], delta) * q;
    sum += A[j] * term;
  }
  return -kSqrtTwoPi / (rootM * B) * entry.scale * sum;
}

}  // extern "C"
