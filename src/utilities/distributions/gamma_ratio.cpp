// Fast regularised incomplete gamma ratios (see gamma_ratio.h).
#include "utilities/distributions/gamma_ratio.h"

#include <cmath>
#include <exception>

#include "utilities/distributions/saddle_density.h"
#include "utilities/elv/limits.h"
#include "utilities/elv/precision.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace gammaratio {

namespace {

// Direct tails below this are left to the ELV routine: the prefactor nears
// the subnormal range, where it would lose digits.
constexpr double kSmallestDirectTail = 1e-280;
// Beyond the ELV routines' shapes nothing else reaches the deep tails:
// there Temme's expansion answers for any tail (it carries its prefactor
// e^-y whole, and gives 0 where y = a rlog(x/a) passes 700, a tail below
// 2e-306).
bool temmeFloorApplies(double a) {
  return !(a > elv::kMaxShape);
}
// A term below 2^-56 of the sum no longer changes it; a continued-fraction
// step within one unit in the last place of 1 leaves the value unchanged.
constexpr double kRelativeStop = 1.4e-17;
constexpr double kFractionStop = 2.3e-16;
constexpr int kMaxTerms = 2000;

// P(a, x) / (x^a e^-x / Gamma(a + 1)) = sum_n x^n / ((a+1) ... (a+n)), x < a.
// All terms are positive and decreasing: summed forwards, the rounding error
// stays within a few units of the last place.
bool lowerSeries(double a, double x, double* sum) {
  double term = 1.0, s = 1.0, an = a;
  for (int n = 0; n < kMaxTerms; ++n) {
    an += 1.0;
    term *= x / an;
    s += term;
    if (term <= kRelativeStop * s) {
      *sum = s;
      return true;
    }
  }
  return false;
}

// Q(a, x) / (x^a e^-x / Gamma(a)) by Legendre's continued fraction
//   1/(x+1-a- 1(1-a)/(x+3-a- 2(2-a)/(x+5-a- ...))),
// for x + 1 - a > 0, from the three-term recurrences of its numerators and
// denominators (as GRATIO does): the recurrences carry the dependency chain
// on multiplications, and the quotient that tests convergence runs beside
// them. Numerators and denominators are rescaled together before they
// overflow, which leaves every convergent unchanged.
bool upperFraction(double a, double x, double* value) {
  double b = x + 1.0 - a;
  // Convergents A_n / B_n from A_0 = 0, B_0 = 1 and A_1 = 1, B_1 = b_0.
  double aPrev = 0.0, bPrev = 1.0;
  double aCur = 1.0, bCur = b;
  double f = aCur / bCur;
  for (int i = 1; i < kMaxTerms; ++i) {
    const double an = -i * (i - a);
    b += 2.0;
    const double aNext = b * aCur + an * aPrev;
    const double bNext = b * bCur + an * bPrev;
    aPrev = aCur;
    bPrev = bCur;
    aCur = aNext;
    bCur = bNext;
    if (std::fabs(bCur) > 1e150) {
      aPrev *= 1e-150;
      bPrev *= 1e-150;
      aCur *= 1e-150;
      bCur *= 1e-150;
    }
    if (bCur == 0.0) continue;
    const double next = aCur / bCur;
    if (std::fabs(next - f) <= kFractionStop * std::fabs(next)) {
      *value = next;
      return true;
    }
    f = next;
  }
  return false;
}

bool finish(double direct, bool directIsLower, double* lower, double* upper,
            double floor = kSmallestDirectTail) {
  if (!(direct >= floor) || !(direct <= 1.0)) return false;
  *lower = directIsLower ? direct : 0.5 + (0.5 - direct);
  *upper = directIsLower ? 0.5 + (0.5 - direct) : direct;
  return true;
}

}  // namespace

static bool tailsUnguarded(double a, double x, double* lower, double* upper) {
  // Quiet comparisons: a NaN must not raise the invalid operation in an armed
  // thread.
  if (!std::isgreater(a, 0.0) || !std::isgreater(x, 0.0) || std::isinf(a) || std::isinf(x)) {
    return false;
  }
  double p, q;
  if (smallShapeGammaRatios(a, x, &p, &q)) return finish(p < q ? p : q, p < q, lower, upper);
  if (temmeGammaRatios(a, x, &p, &q)) {
    // The expansion forms P below a and Q above; the other is 1 minus it.
    const double floor = temmeFloorApplies(a) ? kSmallestDirectTail : 0.0;
    return x < a ? finish(p, true, lower, upper, floor) : finish(q, false, lower, upper, floor);
  }
  const double mass = saddle::poissonMass(a, x);  // x^a e^-x / Gamma(a + 1)
  if (!(mass > 0.0)) return false;
  // The median lies near a - 1/3: the smaller tail is the one on x's side.
  if (x <= a - 1.0 / 3.0) {
    double sum;
    return lowerSeries(a, x, &sum) && finish(mass * sum, true, lower, upper);
  }
  double fraction;
  return upperFraction(a, x, &fraction) && finish(a * mass * fraction, false, lower, upper);
}

// A floating-point trap in the prefactor at extreme arguments (Stirling's
// series squares a shape beyond 1e154) leaves the answer to the ELV routine.
bool tails(double a, double x, double* lower, double* upper) {
  try {
    return tailsUnguarded(a, x, lower, upper);
  } catch (const std::exception&) {
    return false;
  }
}

bool fastTails(double a, double x, double* lower, double* upper) {
  return elv::elvPrecision() == elv::ElvPrecision::Full && tails(a, x, lower, upper);
}

}  // namespace gammaratio
}  // namespace qel
