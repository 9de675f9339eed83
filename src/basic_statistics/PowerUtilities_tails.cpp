// The tail of the noncentral t distribution on the side away from the
// noncentrality, P(T < -t; df, d) for t > 0 and d >= 0.
//
// The kernel's value there is accurate only to about 1e-12 absolutely, and
// for fractional df (Welch's test) it can be wrong by tens of per cent
// (df 10.67, d 3.65, t 1.80: 2.34e-7 against 1.76e-7 by mpmath). A power
// that is this tail alone (a one-sided test against the direction of the
// effect) must keep its relative accuracy, so the tail is integrated here
// from its definition. With T = (Z + d) / sqrt(V / df), T < -t iff
// Z + d < -t sqrt(V / df), and by the symmetry of Z,
//   P(T < -t) = int_0^inf phi(w + d) P(V < df w^2 / t^2) dw,
// whose integrand is positive: no cancellation. In s = ln w the factor
// w^df near 0 becomes an exponential decay, so the range is finite. The
// integral is taken by adaptive 16-point Gauss-Legendre panels (bisection
// until a panel and its halves agree) after a scan that locates the mass.
#include <algorithm>
#include <cmath>

#include "basic_statistics/PowerUtilities.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

namespace {

constexpr double kInvSqrt2Pi = 0.3989422804014327;
// Beyond w = 40 the normal factor is below 1e-347 for any d >= 0.
constexpr double kTopW = 40.0;
constexpr double kScanStep = 0.5;
constexpr int kScanPoints = 160;
constexpr double kRelativeTolerance = 1e-13;
constexpr int kMaxDepth = 12;

// Gauss-Legendre, 16 points on [-1, 1] (the positive half).
constexpr double kNode[8] = {9.501250983763744e-2,  2.8160355077925891e-1, 4.5801677765722739e-1,
                             6.1787624440264375e-1, 7.5540440835500303e-1, 8.6563120238783174e-1,
                             9.4457502307323258e-1, 9.8940093499164993e-1};
constexpr double kWeight[8] = {0.1894506104550685,   0.18260341504492359, 0.16915651939500254,
                               0.14959598881657673,  0.12462897125553387, 0.095158511682492785,
                               0.062253523938647893, 0.027152459411754095};

struct OppositeTail {
  double t, df, d;
  // The integrand in s = ln w, with dw = w ds.
  double operator()(double s) const {
    const double w = std::exp(s);
    const double z = w + d;
    const double chi = mIncompleteGamma(df * w * w / (2.0 * t * t), df / 2.0);
    return kInvSqrt2Pi * std::exp(-0.5 * z * z) * chi * w;
  }
  double panel(double a, double b) const {
    const double h = (b - a) / 2.0, c = (a + b) / 2.0;
    double sum = 0.0;
    for (int i = 0; i < 8; ++i) {
      sum += kWeight[i] * ((*this)(c - h * kNode[i]) + (*this)(c + h * kNode[i]));
    }
    return sum * h;
  }
  double adaptive(double a, double b, double whole, double tolerance, int depth) const {
    const double m = (a + b) / 2.0;
    const double left = panel(a, m), right = panel(m, b);
    // Agreement within the tolerance, or within rounding of the sum.
    const double change = std::fabs(left + right - whole);
    if (depth >= kMaxDepth || change <= tolerance || change <= 4e-16 * std::fabs(left + right)) {
      return left + right;
    }
    return adaptive(a, m, left, tolerance / 2.0, depth + 1) +
           adaptive(m, b, right, tolerance / 2.0, depth + 1);
  }
};

}  // namespace

double mNoncentralTOppositeTail(double t, double df, double d) {
  if (!(t > 0.0) || !(df > 0.0) || !(d >= 0.0) || !std::isfinite(t) || !std::isfinite(df)) {
    return mGetMissingValueCode();
  }
  // P(T < -t) <= P(Z + d < 0) = Phi(-d), below the double range past 38.5.
  if (d > 38.5) return 0.0;
  const OppositeTail f{t, df, d};
  // Scan down from w = 40 for the peak and the ends where the integrand has
  // fallen below 1e-25 of it.
  double values[kScanPoints];
  const double top = std::log(kTopW);
  int peak = 0;
  int count = 0;
  for (int k = 0; k < kScanPoints; ++k) {
    values[k] = f(top - k * kScanStep);
    ++count;
    if (values[k] > values[peak]) peak = k;
    if (k > peak + 4 && values[k] < 1e-25 * values[peak]) break;
  }
  if (!(values[peak] > 0.0)) return 0.0;
  int first = peak;
  while (first > 0 && values[first] >= 1e-25 * values[peak]) --first;
  const double hi = top - first * kScanStep;
  const double lo = top - (count - 1) * kScanStep;
  double total = 0.0;
  for (double a = lo; a < hi; a += kScanStep) total += f.panel(a, std::min(a + kScanStep, hi));
  const double tolerance = kRelativeTolerance * total;
  double refined = 0.0;
  for (double a = lo; a < hi; a += kScanStep) {
    const double b = std::min(a + kScanStep, hi);
    refined += f.adaptive(a, b, f.panel(a, b), tolerance * (b - a) / (hi - lo), 0);
  }
  return std::min(refined, 1.0);
}

}  // namespace qel
