// The range of k independent standard normal variables (the normal range
// with known sigma): distribution, quantile, critical value and P-value.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_NORMAL_RANGE_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_NORMAL_RANGE_H

#include <algorithm>
#include <cmath>
#include <vector>

#include "utilities/RootsAndOptima.h"

namespace qel {

// P(R <= r) or P(R > r), each tail computed in its own right: r <= 0 gives
// lower 0 and upper 1; k < 2 or NaN r the missing value.
double mNormalRangeCdf(double r, int k, bool upperTail);
// The r with P(R <= r) = p, to full precision (the missing value for p
// outside [0, 1) or k < 2; 0 for p = 0).
double mNormalRangeInvCdf(double p, int k);
// The r with P(R > r) = alpha.
double mNormalRangeCritValue(double alpha, int k);
// P(R >= r).
double mNormalRangePValue(double r, int k);

// P(R <= r) for small r:
//   W_k(r) = sqrt(k) (2 pi)^(-(k-1)/2) r^(k-1) exp(c r^2) (1 + e),
//   c = (k-1)^2/(8k) - (k-1)/6 + (k-1)/(24k),
// from Phi(z) - Phi(z - r) = r phi(z) exp(z r/2 + r^2 (z^2/24 - 1/6) + ...)
// integrated against phi(z)^k; |e| <= 1e-3 (k+1) r^4 (it is -8.3e-4 r^4 at
// k = 3 and -6.8e-4 (k+1) r^4 at k = 100 against the lattice sums).
struct CmSmallRangeExpansion {
  explicit CmSmallRangeExpansion(int k)
      : logA(0.5 * std::log(static_cast<double>(k)) - 0.5 * (k - 1.0) * kLog2Pi),
        c((k - 1.0) * (k - 1.0) / (8.0 * k) - (k - 1.0) / 6.0 + (k - 1.0) / (24.0 * k)),
        logErrorFactor(std::log(1e-3 * (k + 1.0))) {}
  static constexpr double kLog2Pi = 1.83787706640934548356;
  double logA, c, logErrorFactor;  // log of the leading factor, c, log 1e-3 (k+1)
};

// One tail of the normal range for a fixed k at many r, for the outer
// integrals of the studentized range and for root searches. With x the
// smallest of the k variables,
//   P(R <= r) = k int phi(x) (Phi(x + r) - Phi(x))^(k-1) dx,
//   P(R > r)  = k int phi(x) Q(x)^(k-1) (1 - (1 - Q(x + r)/Q(x))^(k-1)) dx,
// Q the upper normal tail (the second since k int phi Q^(k-1) = 1), both by
// the trapezoidal rule on the lattice x = i h. The integrands are entire and
// decay like normal densities, so the rule converges geometrically in 1/h^2
// (Trefethen and Weideman, SIAM Review 56 (2014) 385); h follows the width
// of the integrand (that of the smallest of k normals, 1/sqrt(k) for the
// lower tail at small r). The sum walks out from the mode until the terms
// fall below 1e-16 of it; on the left of the upper tail's integrand, once
// its bracket is 1 to double precision, the rest is a kept running sum.
// phi(x), Phi(x), Q(x) and Q(x)^(k-1) are kept per lattice point, and along
// a walk phi(x + r) follows by recurrence, so each further r costs one
// rational erfc (no exp) per point.
class CmNormalRangeLattice {
 public:
  CmNormalRangeLattice(int k, bool upperTail);
  // The chosen tail at r > 0 (r finite).
  double operator()(double r);

 private:
  struct Node {
    double upper, lower, kPhi, base,
        invUpper;  // Q(x), Phi(x), k phi(x), k phi(x) Q(x)^(k-1), 1/Q(x)
  };
  const Node& node(int i);
  // The integrand at x = i h, y = x + r, given phi(y); Phi(y) to lowerY.
  double term(int i, double y, double phiY, double* lowerY);
  // The sum of k phi(x) Q(x)^(k-1) over the lattice up to index i.
  double prefix(int i);
  static constexpr int kSeriesTerms = 7;
  int mK;
  bool mUpper;
  double mH, mDecay, mUnitBracket;
  double mSeries[kSeriesTerms] = {};
  int mFirst, mLast;  // lattice indices kept
  std::vector<Node> mNodes;
  std::vector<char> mReady;
  std::vector<double> mPrefix;
  int mPrefixFirst, mPrefixLast;
};

// The root of f, a monotone function of y = log r (a log tail minus its
// target; slopeSign +1 if it increases), from y0 and y1: secant steps, at
// most maxStep each (marching where f is flat), until the
// sign changes, then regula falsi with the Illinois halving (Dowell and
// Jarratt, BIT 11 (1971) 168); y stays in [-700, 700]. Returns exp(y) once
// |f| < fTolerance or a step is below yTolerance.
template <class F>
double mSolveOnLogScale(F f, int slopeSign, double y0, double y1, double maxStep, double fTolerance,
                        double yTolerance) {
  auto clampY = [](double y) { return y < -700.0 ? -700.0 : (y > 700.0 ? 700.0 : y); };
  y0 = clampY(y0), y1 = clampY(y1);
  double f0 = f(y0), f1 = f(y1);
  bool bracketed = (f0 > 0.0) != (f1 > 0.0);
  for (int i = 0; i < 300; ++i) {
    if (std::fabs(f1) < fTolerance || std::fabs(y1 - y0) < yTolerance) break;
    double y2 = f1 != f0 ? y1 - f1 * (y1 - y0) / (f1 - f0) : HUGE_VAL;
    if (!bracketed) {
      if (!std::isfinite(y2)) y2 = y1 + (f1 > 0.0 ? -slopeSign : slopeSign) * maxStep;
      y2 = clampY(std::max(y1 - maxStep, std::min(y1 + maxStep, y2)));
      if (y2 == y1) break;
      const double f2 = f(y2);
      bracketed = (f2 > 0.0) != (f1 > 0.0);
      y0 = y1, f0 = f1, y1 = y2, f1 = f2;
      continue;
    }
    if (!(y2 > std::min(y0, y1) && y2 < std::max(y0, y1))) y2 = 0.5 * (y0 + y1);
    const double f2 = f(y2);
    if ((f2 > 0.0) != (f1 > 0.0)) {
      y0 = y1, f0 = f1;
    } else {
      f0 *= 0.5;
    }
    y1 = y2, f1 = f2;
  }
  return std::exp(y1);
}

// The range distribution minus a target, for root finders.
class CmNormalRangeCdf : public CmRealFunction {
 public:
  CmNormalRangeCdf(int k, double target) : mK(k), mTarget(target) {}
  double operator()(double r) override { return mNormalRangeCdf(r, mK, false) - mTarget; }

 private:
  int mK;
  double mTarget;
};

// The integrand of P(R <= r): k phi(x) (Phi(x + r) - Phi(x))^(k - 1).
class CmNormalRangePdfLike : public CmRealFunction {
 public:
  CmNormalRangePdfLike(int k, double r) : mK(k), mR(r) {}
  double operator()(double x) override;

 private:
  int mK;
  double mR;
};

}  // namespace qel

#endif
