// The studentized range: P-value, critical value and the 5 percent table.
//
// The upper tail is integrated over t = log s, where the density of s,
//   g(t) = s f(s) = 2 (df/2)^(df/2) exp(df t - df e^(2t)/2) / Gamma(df/2),
// is smooth and log-concave for every df > 0 (no endpoint singularity for
// df < 1), and
//   P(Q > q) = int g(t) U(q e^t) dt,   U = 1 - W_k, the normal range upper tail
// computed in its own right (CmNormalRangeLattice, one lattice shared by all
// nodes). The integrand is entire in t, analytic in the strip |Im t| < pi/4
// and decays at both ends, so the trapezoidal rule on the whole line
// converges geometrically (Trefethen and Weideman, SIAM Review 56 (2014)
// 385). The step is the least of 0.14 (the strip), 0.46/sqrt(df) (0.65 of
// the width 1/sqrt(2 df) of g) and 0.6 of the relative spread of the range
// (the width of U(q e^t) in t); on 876 points (k = 2 to 100, df = 0.3 to
// 1e5, q to 1e6) it agrees with the former composite Gauss-Legendre panels,
// themselves within 1e-12 of mpmath, to 3e-10. The sum walks out from an
// anchor near the mode until the terms fall below 1e-13 of it. Where q e^t is small, U is 1 - W
// with the expansion
//   W_k(w) = sqrt(k) (2 pi)^(-(k-1)/2) w^(k-1) exp(c w^2) (1 + O(k w^4)),
//   c = (k-1)^2/(8k) - (k-1)/6 + (k-1)/(24k)
// (from Phi(z) - Phi(z - w) = w phi(z) exp(z w/2 + w^2 (z^2/24 - 1/6) + ...)
// integrated against phi(z)^k), and once also e^(2t) is small the rest of
// the sum is a few geometric series in closed form. So a far tail such as
// q = 1e300 at df = 1 costs what a central P-value does. Against mpmath
// double integrals this holds 1e-9 absolute and 1e-7 relative where the
// single 48-point rules over a chi-square quantile range with a linear normal
// table (a fixed, low-accuracy design) are off by up to 1e-3.
#include "utilities/distributions/studentized_range.h"

#include <algorithm>
#include <cmath>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/normal_range.h"
#include "utilities/distributions/studentized_common.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace {

constexpr double kSqrt2 = 1.41421356237309504880;

const double kTukeyTable[60][8] = {
#include "utilities/distributions/tukey_table.inc"
};

using studentized::LogChi;
using studentized::safeExp;

// sum over j >= 0 of exp(a + alpha t_j + beta e^(2 t_j)), t_j = t0 - j h,
// given logFirst = a + alpha t0 and z = beta e^(2 t0) (|z| <= 1/2), by
// expanding exp(beta e^(2t)): each power is a geometric series in j.
double geometricTail(double logFirst, double alpha, double z, double h) {
  const double first = safeExp(logFirst);
  double coefficient = 1.0, sum = 0.0;
  for (int m = 0; m < 40 && first > 0.0; ++m) {
    const double term = coefficient * first / -std::expm1(-(alpha + 2.0 * m) * h);
    sum += term;
    if (std::fabs(term) <= 1e-18 * std::fabs(sum)) break;
    coefficient *= z / (m + 1);
  }
  return sum;
}

class OuterSum {
 public:
  OuterSum(double q, int k, double df, CmNormalRangeLattice& upper)
      : mLogQ(std::log(q)), mK(k), mDf(df), mG(df), mSmall(k), mUpper(upper) {
    // The relative spread of the range, sd(R)/E(R) (0.52 at k = 3, 0.12 at
    // k = 100), is the width of U(q e^t) in t.
    const double spread = 0.85 / (1.0 + 1.3 * std::log(static_cast<double>(k)));
    mH = std::min({0.14, 0.46 / std::sqrt(df), 0.6 * spread});
  }

  double operator()() {
    const double t0 = anchor();
    // Terms are summed relative to g at the anchor, so a far tail of 1e-300
    // keeps its digits (denormals are zero in the armed frame).
    mLogScale = std::min(0.0, std::max(mG(t0), -600.0));
    double sum = 0.0;
    const double first = node(t0, nullptr);
    sum = first;
    // Right, until negligible past the mode (both factors fall beyond it).
    double previous = first;
    for (int j = 1; j < 100000; ++j) {
      const double f = node(t0 + j * mH, nullptr);
      sum += f;
      // A zero from U (r beyond its range) or from g past its mode ends the walk;
      // one from g below its mode does not.
      const double t = t0 + j * mH;
      if (f == 0.0 && (t >= 0.0 || logG(t) >= -745.0)) break;
      if (f <= 1e-13 * sum && f <= previous) break;
      previous = f;
    }
    // Left, until negligible or the rest has a closed form.
    previous = first;
    for (int j = 1; j < 100000; ++j) {
      bool closed = false;
      const double f = node(t0 - j * mH, &closed);
      sum += f;
      if (closed) break;
      // g(t) underflows below its mode: so it does further left.
      if (f == 0.0 && logG(t0 - j * mH) < -745.0 && t0 - j * mH < 0.0) break;
      if (sum > 0.0 && f <= 1e-13 * sum && f <= previous) break;
      previous = f;
    }
    return std::max(0.0, std::min(1.0, mH * sum * std::exp(mLogScale)));
  }

 private:
  // Near the mode: where df (1 - e^(2t)) balances the fall of U, about
  // w = q e^t = sqrt(2 df + 4) for t < 0 (U falls like exp(-w^2/4)), and at
  // the mode t = 0 of g when q is below that.
  double anchor() const {
    const double w = std::sqrt(2.0) * std::sqrt(mDf + 2.0);
    return std::min(0.0, std::log(w) - mLogQ);
  }

  // log g(t) relative to the scale.
  double logG(double t) const { return mG(t) - mLogScale; }

  // g(t) U(q e^t); with closed non-null, where the expansion holds and
  // e^(2t) is small, the closed-form sum of this node and all to its left.
  double node(double t, bool* closed) {
    const double logW = mLogQ + t;
    const double logGt = logG(t);
    if (logGt < -745.0) return 0.0;
    const double w2 = logW < 300.0 ? std::exp(2.0 * logW) : 1e290;
    const double logSmall = mSmall.logA + (mK - 1) * logW + mSmall.c * w2;
    // The expansion where its relative error 1e-3 (k+1) w^4 is small and
    // W times it below 1e-13.
    const double logErr = mSmall.logErrorFactor + 4.0 * logW;
    if (logErr <= std::log(1e-2) && logSmall + logErr <= std::log(1e-13)) {
      // g(t) = exp(c0 + x + df t - x e^(2t)) and
      // g W = exp(c0 + x + df t + log A + (k-1) log w + (c w^2 - x e^(2t))).
      const double xe = t < 0.0 ? mG.x * std::exp(2.0 * t) : 1.0;
      const double zW = mSmall.c * w2 - xe;
      if (closed != nullptr && t < 0.0 && xe + std::fabs(zW) <= 0.5) {
        *closed = true;
        const double logFirst = mG.c0 + mG.x + mDf * t - mLogScale;
        const double gSum = geometricTail(logFirst, mDf, -xe, mH);
        const double wSum =
            geometricTail(logFirst + mSmall.logA + (mK - 1) * logW, mDf + mK - 1, zW, mH);
        return gSum - wSum;
      }
      return safeExp(logGt) * (1.0 - safeExp(logSmall));
    }
    // Beyond w = e^700 the normal range tail is 0.
    return logW > 700.0 ? 0.0 : safeExp(logGt) * mUpper(std::exp(logW));
  }

  double mLogQ;
  int mK;
  double mDf;
  LogChi mG;
  CmSmallRangeExpansion mSmall;
  CmNormalRangeLattice& mUpper;
  double mH, mLogScale = 0.0;
};

double upperTail(double q, int k, double df, CmNormalRangeLattice& lattice) {
  return OuterSum(q, k, df, lattice)();
}

bool badArguments(int k, double df) {
  return k < 2 || std::isnan(df) || !(df > 0.0);
}

// The q with P(Q > q) = alpha: the secant method on log P against log q
// (nearly linear: a power of q in the far tail), kept inside a bracket by
// the Illinois rule once one is found, from the Bonferroni start
// q0 = sqrt(2) t_df(1 - alpha / (k (k-1))) (C(k, 2) pairs, each
// sqrt(2) |T_df|; within 15 percent for k <= 100), to a step of 1e-9 in
// log q (or 1e-11 in log P), far below the two-decimal rounding. About five
// P-values.
double solveUpper(double alpha, int k, double df) {
  CmNormalRangeLattice lattice(k, true);
  const double target = std::log(alpha);
  auto f = [&](double y) {
    const double p = std::isinf(df) ? lattice(std::exp(y)) : upperTail(std::exp(y), k, df, lattice);
    return (p > 0.0 ? std::log(p) : -745.0) - target;
  };
  const double pairs = 0.5 * k * (k - 1.0);
  const double tail = 0.5 * alpha / pairs;
  // (df capped at 1e10 for the start: the t law is then normal to 1e-10.)
  const double startDf = std::min(df, 1e10);
  double t0 = -mTInvCdf(tail, startDf, 0.0);
  if (mIsNumericMissing(t0) || !(t0 > 0.0 && t0 < 1e300)) t0 = 1.0;
  const double y0 = std::log(kSqrt2 * t0), f0 = f(y0);
  // The first step is Newton's with the slope of the Bonferroni model,
  // d log P / d log q = -t f_t(t) / P(T > t), held in [-200, -0.5].
  double slope = -t0 * mTPdf(t0, startDf, 0.0) / tail;
  if (!(slope < -0.5)) slope = -0.5;
  slope = std::max(slope, -200.0);
  const double step = std::max(-1.0, std::min(1.0, -f0 / slope));
  auto cached = [&](double y) { return y == y0 ? f0 : f(y); };
  return mSolveOnLogScale(cached, -1, y0, y0 + (std::fabs(step) > 1e-6 ? step : 1e-6), 1.0, 1e-11,
                          1e-9);
}

}  // namespace

bool mIsStudentizedRangePossible(int k, double df, double alpha) {
  if (k == 2) return true;
  if (df <= 2.0) return std::fabs(alpha - 0.05) <= 1e-12 && k <= 10;
  if (k >= 40 && df <= 5.0) return false;
  if (alpha < 0.01) return !((k >= 15 && k <= 40 && df <= 10.0) || k > 40);
  return true;
}

bool mIsStudentizedMaximumModulusPossible(int k, double df, double alpha) {
  if (k == 1) return true;
  if (df <= 2.0) return false;
  if (k >= 40 && df <= 5.0) return false;
  if (alpha < 0.01) return !((k >= 15 && k <= 40 && df <= 10.0) || k > 40);
  return true;
}

bool mTukeyTable(double df, int k, double alpha, double* q) {
  if (!(df >= 1.0 && df <= 60.0) || !mIsInteger(df) || k < 3 || k > 10 ||
      !(std::fabs(alpha - 0.05) <= 1e-12))
    return false;
  *q = kTukeyTable[static_cast<int>(df) - 1][k - 3];
  return true;
}

double mStudentizedRangePValue(double q, int k, double df) {
  if (badArguments(k, df) || std::isnan(q)) return mGetMissingValueCode();
  if (q <= 0.0) return 1.0;
  if (std::isinf(q)) return 0.0;
  // k = 2: Q = sqrt(2) |T_df|.
  if (k == 2) return std::min(1.0, 2.0 * mTCdf(q / kSqrt2, df, 0.0, true));
  if (std::isinf(df)) return mNormalRangeCdf(q, k, true);
  CmNormalRangeLattice lattice(k, true);
  return upperTail(q, k, df, lattice);
}

double mStudentizedRangeCritValue(double alpha, int k, double df) {
  if (badArguments(k, df) || std::isnan(alpha) || !(alpha > 0.0 && alpha < 1.0))
    return mGetMissingValueCode();
  if (k == 2) {
    const double t = mTInvCdf(1.0 - 0.5 * alpha, df, 0.0);
    return mIsNumericMissing(t) ? t : kSqrt2 * t;
  }
  double q = 0.0;
  if (mTukeyTable(df, k, alpha, &q)) return q;
  q = solveUpper(alpha, k, df);
  return mNearestInteger(100.0 * q) / 100.0;
}

}  // namespace qel
