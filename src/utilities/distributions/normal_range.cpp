// The normal range distribution,
//   P(R <= r) = k int phi(x) (Phi(x + r) - Phi(x))^(k-1) dx,
// by the trapezoidal rule on a lattice (CmNormalRangeLattice). The upper tail
// has its own integrand: since k int phi(x) Q(x)^(k-1) dx = 1 with Q the
// upper normal tail,
//   P(R > r) = k int phi(x) Q(x)^(k-1) (1 - (1 - Q(x+r)/Q(x))^(k-1)) dx,
// and the bracket, with rho = Q(x+r)/Q(x), is summed as its binomial series
// (k-1) rho - C(k-1, 2) rho^2 + ... where (k-1) rho is small, so a tail of
// 1e-300 keeps its relative accuracy. A single 16-point rule over [-8, 8] misses
// these integrands by 2% to 90% (k = 3 to 50, r = 0.5 to 5), where the
// lattice sums agree with mpmath to 1e-13.
#include "utilities/distributions/normal_range.h"

#include <algorithm>
#include <cmath>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/studentized_common.h"

namespace qel {
namespace {

constexpr double kSqrtHalf = 0.70710678118654752440;
// The lattice spans x in [-48, 12]: beyond r = 54 both tails are 0 and 1 to
// double precision, and the mass of P(R > r) lies near x = -r/2.
constexpr double kLatticeLow = -48.0;
constexpr double kLatticeHigh = 12.0;
// k phi(x) Q(x)^(k-1) below x = -9.5 is under 2e-20 k: its sums start there.
constexpr double kPrefixLow = 9.5;

using studentized::phi;
using studentized::upperNormalFromDensity;

double upperNormal(double x) {
  return 0.5 * std::erfc(x * kSqrtHalf);
}
// Q(y) and Phi(y), the smaller one from erfc and the other as its complement.
void normalTails(double y, double* upper, double* lower) {
  if (y >= 0.0) {
    *upper = upperNormal(y);
    *lower = 1.0 - *upper;
  } else {
    *lower = upperNormal(-y);
    *upper = 1.0 - *lower;
  }
}

// b^m for m >= 1 by repeated squaring.
double integerPower(double b, int m) {
  double result = 1.0;
  while (true) {
    if (m & 1) result *= b;
    m >>= 1;
    if (m == 0) return result;
    b *= b;
  }
}

// (Phi(x + r) - Phi(x))^(k - 1), each difference from the smaller tails.
double lowerBracket(double x, double r, int k) {
  const double d =
      x >= 0.0 ? upperNormal(x) - upperNormal(x + r) : upperNormal(-x - r) - upperNormal(-x);
  return d <= 0.0 ? 0.0 : integerPower(d, k - 1);
}

// P(R > r) <= C(k, 2) P(|Z1 - Z2| > r) = C(k, 2) erfc(r/2): once that bound
// underflows the tails are 0 and 1.
bool farTail(double r, int k) {
  return 0.5 * k * (k - 1.0) * std::erfc(0.5 * r) == 0.0;
}

// The mode of the density k phi(x) Q(x)^(k-1) of the smallest of k normals,
// near -sqrt(2 log k) + 0.6 (within 0.3 for k = 2 to 1000).
double smallestMode(int k) {
  return 0.6 - std::sqrt(2.0 * std::log(static_cast<double>(k)));
}

}  // namespace

CmNormalRangeLattice::CmNormalRangeLattice(int k, bool upperTail) : mK(k), mUpper(upperTail) {
  // Steps that hold the trapezoidal error below 3e-13 of the tail (checked
  // against steps a third as large for k = 2 to 1000 and r up to 50): the
  // upper integrand has the width of the smallest of k normals, the lower one
  // at small r that of phi(x)^k.
  const double logK = std::log(static_cast<double>(k));
  mH = 0.5 / (1.0 + 0.5 * logK);
  if (!upperTail) mH = std::min(mH, 0.7 / std::sqrt(static_cast<double>(k)));
  // 1 - (1 - rho)^m = m rho (1 + c1 rho (1 + c2 rho (...))), c_j = -(m - j)/(j + 1).
  for (int j = 1; j < kSeriesTerms; ++j) mSeries[j] = -(k - 1.0 - j) / (j + 1.0);
  mDecay = std::exp(-mH * mH);
  mUnitBracket = 0.5 * std::pow(1e-17, 1.0 / (k - 1.0));
  mFirst = static_cast<int>(std::floor(kLatticeLow / mH));
  mLast = static_cast<int>(std::ceil(kLatticeHigh / mH));
  mNodes.resize(mLast - mFirst + 1);
  mPrefix.assign(mLast - mFirst + 1, 0.0);
  mPrefixFirst = std::max(mFirst, static_cast<int>(std::ceil(-kPrefixLow / mH)));
  mPrefixLast = mPrefixFirst - 1;
  mReady.assign(mLast - mFirst + 1, 0);
}

const CmNormalRangeLattice::Node& CmNormalRangeLattice::node(int i) {
  Node& n = mNodes[i - mFirst];
  if (!mReady[i - mFirst]) {
    const double x = i * mH;
    normalTails(x, &n.upper, &n.lower);
    n.kPhi = mK * phi(x);
    n.base = n.upper > 0.0 ? n.kPhi * integerPower(n.upper, mK - 1) : 0.0;
    n.invUpper = n.upper > 0.0 ? 1.0 / n.upper : 0.0;
    mReady[i - mFirst] = 1;
  }
  return n;
}

double CmNormalRangeLattice::prefix(int i) {
  if (i < mPrefixFirst) return 0.0;
  for (; mPrefixLast < i; ++mPrefixLast) {
    const double before = mPrefixLast < mPrefixFirst ? 0.0 : mPrefix[mPrefixLast - mFirst];
    mPrefix[mPrefixLast + 1 - mFirst] = before + node(mPrefixLast + 1).base;
  }
  return mPrefix[i - mFirst];
}

double CmNormalRangeLattice::term(int i, double y, double phiY, double* lowerY) {
  const Node& n = node(i);
  if (mUpper && n.base == 0.0) return 0.0;
  // Q(y) and Phi(y), the smaller one from phi(y), the other as its complement.
  double qy = 0.0, py = 0.0;
  if (y >= 0.0) {
    qy = upperNormalFromDensity(y, phiY);
    py = 1.0 - qy;
  } else {
    py = upperNormalFromDensity(-y, phiY);
    qy = 1.0 - py;
  }
  *lowerY = py;
  // Phi(x + r) - Phi(x) from the smaller tails.
  const double d = y > 0.0 ? n.upper - qy : py - n.lower;
  if (!mUpper) return d <= 0.0 ? 0.0 : n.kPhi * integerPower(d, mK - 1);
  const int m = mK - 1;
  const double rho = qy * n.invUpper;
  // 1 - (1 - rho)^m: its binomial series where m rho < 0.01 (seven terms,
  // below 1e-18), directly otherwise (then 1 - (1 - rho)^m >= 0.01 / e and
  // its rounding at most 3e-14 m relative).
  if (m * rho < 0.01) {
    double bracket = 1.0;
    for (int j = kSeriesTerms - 1; j >= 1; --j) bracket = 1.0 + mSeries[j] * rho * bracket;
    return n.base * m * rho * bracket;
  }
  return n.base * (1.0 - integerPower(std::max(0.0, d * n.invUpper), m));
}

double CmNormalRangeLattice::operator()(double r) {
  if (!(r > 0.0)) return mUpper ? 1.0 : 0.0;
  if (farTail(r, mK)) return mUpper ? 0.0 : 1.0;
  // Start at the mode: near -r/2 for large r (the extremes straddle 0), the
  // mode of the smallest for small r (upper), -r/2 (lower).
  const double x0 = mUpper ? std::min(-0.5 * r, smallestMode(mK)) : -0.5 * r;
  const int start = std::max(mFirst, std::min(mLast, static_cast<int>(std::lround(x0 / mH))));
  double sum = 0.0, first = 0.0;
  // Walk while the terms grow or still count; a run of zeros at the start
  // (far tails below the double range) is walked over for 16 units. Along
  // a walk y = x + r moves by h, so phi(y) follows from its last value:
  // phi(y +- h) = phi(y) e^(-+y h - h^2/2), the factor itself times e^(-h^2)
  // per step.
  const int zeroRun = static_cast<int>(16.0 / mH);
  for (int dir = 1; dir >= -1; dir -= 2) {
    int i = dir == 1 ? start : start - 1;
    double y = i * mH + r;
    double phiY = phi(y);
    double factor = std::exp(std::min(700.0, -dir * y * mH - 0.5 * mH * mH));
    double previous = dir == 1 ? HUGE_VAL : first;
    for (int steps = 0; i >= mFirst && i <= mLast; i += dir, ++steps) {
      double lowerY = 0.0;
      const double f = term(i, y, phiY, &lowerY);
      sum += f;
      if (steps == 0 && dir == 1) first = f;
      // Left of here the bracket of P(R > r) is 1 to double precision:
      // (Phi(x + r) - Phi(x))/Q(x) <= 2 Phi(x + r) and Phi(x + r) falls
      // with x. The terms are then those of k phi(x) Q(x)^(k-1), summed once.
      if (mUpper && dir == -1 && y < 0.0 && lowerY <= mUnitBracket) {
        sum += prefix(i - 1);
        break;
      }
      if (f <= 1e-16 * sum && f <= previous && (sum > 0.0 || steps > zeroRun)) break;
      previous = f;
      phiY *= factor;
      factor *= mDecay;
      y = (i + dir) * mH + r;
    }
  }
  return std::max(0.0, std::min(1.0, mH * sum));
}

namespace {

// The chosen tail at r > 0 (finite): closed forms for k = 2 (R = sqrt(2)
// |Z|), beyond the double range and, for the lower tail, at small r, where
// the lattice's Phi(x + r) - Phi(x) would lose 1e-16/r relative; the lattice
// otherwise.
double chosenTail(CmNormalRangeLattice& lattice, double r, int k, bool upperTail) {
  if (k == 2) return upperTail ? std::erfc(0.5 * r) : std::erf(0.5 * r);
  if (farTail(r, k)) return upperTail ? 0.0 : 1.0;
  if (!upperTail) {
    const CmSmallRangeExpansion small(k);
    const double logR = std::log(r);
    if (small.logErrorFactor + 4.0 * logR <= std::log(1e-15))
      return std::exp(std::max(-745.0, small.logA + (k - 1) * logR + small.c * r * r));
  }
  return lattice(r);
}

// The r where the chosen tail reaches target, by the secant method on the
// log tail against log r (linear in the polynomial lower tail, nearly
// quadratic in the upper one) from r = 3 and 3.5, to full precision.
double solveTail(double target, int k, bool upperTail) {
  CmNormalRangeLattice tail(k, upperTail);
  const double logTarget = std::log(target);
  auto f = [&](double y) {
    const double r = std::exp(y);
    const double v = chosenTail(tail, r, k, upperTail);
    return (v > 0.0 ? std::log(v) : -745.0) - logTarget;
  };
  return mSolveOnLogScale(f, upperTail ? -1 : 1, std::log(3.0), std::log(3.5), 3.0, 1e-15, 1e-15);
}

}  // namespace

double CmNormalRangePdfLike::operator()(double x) {
  return mK * phi(x) * lowerBracket(x, mR, mK);
}

double mNormalRangeCdf(double r, int k, bool upperTail) {
  if (k < 2 || std::isnan(r)) return mGetMissingValueCode();
  if (r <= 0.0) return upperTail ? 1.0 : 0.0;
  if (std::isinf(r)) return upperTail ? 0.0 : 1.0;
  CmNormalRangeLattice lattice(k, upperTail);
  return chosenTail(lattice, r, k, upperTail);
}

double mNormalRangeInvCdf(double p, int k) {
  if (k < 2 || !(p >= 0.0 && p < 1.0)) return mGetMissingValueCode();
  if (p == 0.0) return 0.0;
  return p <= 0.5 ? solveTail(p, k, false) : solveTail(1.0 - p, k, true);
}

double mNormalRangeCritValue(double alpha, int k) {
  if (k < 2 || !(alpha > 0.0 && alpha <= 1.0)) return mGetMissingValueCode();
  if (alpha == 1.0) return 0.0;
  return alpha >= 0.5 ? solveTail(1.0 - alpha, k, false) : solveTail(alpha, k, true);
}

double mNormalRangePValue(double r, int k) {
  return mNormalRangeCdf(r, k, true);
}

}  // namespace qel
