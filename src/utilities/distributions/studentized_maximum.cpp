// The conditional laws of the studentized maximum and maximum modulus and
// the outer integral over the chi distribution of s.
//
// Inner integral, for w = x s:
//   U(w) = int phi(z) (1 - prod_j F_j(z)^m_j) dz,
// 1 - prod_j F_j formed from the smaller normal tail of each factor: those
// below 1e-4 by the series of log(1 - q) and expm1, so that a far upper
// tail keeps its relative accuracy, the others by their product. The integrand is a sum of pieces
// phi(z) (1 - F_j): piece j is P(Z in dz, Y_j > w) and lies, relative to P(Y_j > w) <= U(w), within
// 8 of the point l_j w up to exp(-32) (given Y_j > w, Z is l_j Y_j + c_j E with Y_j - w below a
// half-normal). So the z-range is the hull of the l_j w widened by 8 (by symmetry only z >= 0 for
// the modulus, whose factors are even in z and in l_j). The integrand is entire and decays like
// phi, so the trapezoidal rule on a lattice over that range converges geometrically in 1/h^2
// (Trefethen and Weideman, SIAM Review 56 (2014) 385), with the step set by the narrowest factor.
// The normal tails come from the rational erfc of ACM TOMS 708 times phi, and phi at the points
// a_j, -b_j follows from its last value along the lattice, so a point costs a few multiplications
// per factor and one expm1. Where the product decreases along the lattice, its end once the product
// is negligible is phi alone.
//
// Outer integral over t = log s for df < 4 (for df >= 4 the trapezoidal
// sum of trapezoidTail below), where the density of s is
//   g(t) = 2 a^a exp(2 a t - a e^(2t)) / Gamma(a),  a = df/2,
// written as 2 sqrt(a/(2 pi)) exp(-stirlerr(a) - a (e^(2t) - 1 - 2t)), free of
// cancellation for df in the millions (beyond 1e15 the known-sigma law is
// used, an O(1/df) change). It starts where the chi-square lower tail is
// below 1e-16 of a lower bound of the answer (the tail of one variable) and
// walks 16-point panels sized by the local slope and curvature of log g and
// by the scale 1/r^2 of U at r = x e^t, until a log-concavity bound on the
// rest is below 1e-17 of that lower bound. U is not integrated at each of
// these nodes where it can be avoided: log U is analytic near the real axis,
// so a Chebyshev interpolant on the range of w (Trefethen, Approximation
// Theory and Approximation Practice, 2013, ch. 8: geometric convergence),
// accepted by the decay of its coefficients, needs 17 to 65 inner integrals
// for 100 to 250 nodes.
//
// A single 48-point rule over a chi-square quantile range with a 141-entry
// linear normal table (the classic low-accuracy design) is off by up to
// 5e-5 absolute and 2e-4 relative from the table alone; this holds 1e-9
// absolute and 1e-7 relative against mpmath (under 1e-10 measured on 294
// double integrals).
#include <algorithm>
#include <cmath>

#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/normal_range.h"
#include "utilities/distributions/studentized_common.h"
#include "utilities/distributions/studentized_maximum_inner.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {
namespace {

constexpr double kSqrtHalf = 0.70710678118654752440;
constexpr double kSqrt2 = 1.41421356237309504880;

// 16-point Gauss-Legendre rule on [-1, 1]: positive nodes and weights.
constexpr double kNode[8] = {0.98940093499164993, 0.94457502307323258, 0.86563120238783174,
                             0.75540440835500303, 0.61787624440264375, 0.45801677765722739,
                             0.28160355077925891, 0.09501250983763744};
constexpr double kWeight[8] = {0.027152459411754095, 0.062253523938647893, 0.095158511682492785,
                               0.12462897125553387,  0.14959598881657673,  0.16915651939500254,
                               0.18260341504492359,  0.1894506104550685};

template <class F>
double gauss16(double lo, double hi, const F& f) {
  const double c = 0.5 * (lo + hi), h = 0.5 * (hi - lo);
  double sum = 0.0;
  for (int i = 0; i < 8; ++i) sum += kWeight[i] * (f(c + h * kNode[i]) + f(c - h * kNode[i]));
  return h * sum;
}

// Upper normal tail Q(x) = P(N > x).
double upperNormal(double x) {
  return 0.5 * std::erfc(x * kSqrtHalf);
}
using studentized::safeExp;

// log Phi(x) from the smaller tail; -inf (flagged by false) where Phi(x)
// underflows.
bool logNormalCdf(double x, double* out) {
  if (x >= 0.0) {
    *out = std::log1p(-upperNormal(x));
    return true;
  }
  const double p = upperNormal(-x);
  if (!(p > 0.0)) return false;
  *out = std::log(p);
  return true;
}

// Beyond the hull of the peaks l_j w, in units of z.
constexpr double kReach = 8.0;

// log(1 - q) for 0 <= q < 1, by its series where q is small.
double log1mSmall(double q) {
  if (q < 1e-4) return -q * (1.0 + q * (0.5 + q * (1.0 / 3.0 + 0.25 * q)));
  return std::log1p(-q);
}

}  // namespace

CmMaximumInner::CmMaximumInner(const std::vector<double>& distinct,
                               const std::vector<unsigned>& counts, bool modulus)
    : mModulus(modulus) {
  for (size_t j = 0; j < distinct.size(); ++j) {
    const double m = counts[j];
    mK += m;
    const double d = modulus ? std::fabs(distinct[j]) : distinct[j];
    if (d == 0.0) {
      mZeros += m;
      continue;
    }
    // The modulus merges l and -l (its law is even in each lambda).
    bool merged = false;
    for (Factor& f : mFactors) {
      if (f.d == d) {
        f.m += m;
        merged = true;
      }
    }
    if (merged) continue;
    const double c = std::sqrt((1.0 - d) * (1.0 + d));
    mFactors.push_back({d, c, 1.0 / c, m});
  }
}

// The points y = (w -+ d_j z)/c_j of one z-lattice point and phi(y), one
// lane per point, held in arrays. phi along the lattice, y_i = y_0 + i s,
// needs no exponential at most points:
// phi(y + s) = phi(y) r, r = exp(-y s - s^2/2), and r itself is multiplied
// by exp(-s^2) per step. Restarted from exp every 32 steps (the rounding,
// about n^2/2 units in the last place after n steps, stays below 2e-13
// relative) and wherever phi is below 1e-250. A last lane without a tail
// walks phi(z) itself.
class TailLanes {
 public:
  explicit TailLanes(size_t count) : mSize(count + 1), mData(kArrays * mSize, 0.0) {}
  // Lane j: y = base + slope z, the lattice step moving y by step.
  void set(size_t j, double base, double slope, double step) {
    at(kBase)[j] = base;
    at(kSlope)[j] = slope;
    at(kStep)[j] = step;
    at(kDecay)[j] = std::exp(-step * step);
  }
  // Moves every lane to z, the previous point plus the step (the first call
  // starts there).
  void moveTo(double z) {
    double *y = at(kY), *p = at(kPhi), *r = at(kRatio);
    const double *base = at(kBase), *slope = at(kSlope), *decay = at(kDecay);
    const bool restartAll = mSteps == 0 || mSteps >= 32;
    for (size_t l = 0; l < mSize; ++l) {
      y[l] = base[l] + slope[l] * z;
      p[l] *= r[l];
      r[l] *= decay[l];
      if (restartAll || p[l] < 1e-250) restart(l);
    }
    mSteps = restartAll ? 1 : mSteps + 1;
  }
  const double* y() const { return &mData[kY * mSize]; }
  const double* density() const { return &mData[kPhi * mSize]; }
  // Q(|y|) of lane l.
  double tail(size_t l) const {
    return studentized::upperNormalFromDensity(std::fabs(y()[l]), density()[l]);
  }

 private:
  enum { kBase, kSlope, kStep, kDecay, kY, kPhi, kRatio, kArrays };
  double* at(int array) { return &mData[array * mSize]; }
  void restart(size_t l) {
    const double y = at(kY)[l], s = at(kStep)[l];
    // A lane at the point of the previous one but walking the other way (a
    // and -b of the modulus at z = 0) shares its phi, and the two ratios
    // multiply to exp(-s^2).
    const double *p0 = at(kPhi), *r0 = at(kRatio);
    if (l > 0 && y == at(kY)[l - 1] && s == -at(kStep)[l - 1] && p0[l - 1] > 0.0 &&
        r0[l - 1] > 1e-300) {
      at(kPhi)[l] = p0[l - 1];
      at(kRatio)[l] = at(kDecay)[l] / r0[l - 1];
      return;
    }
    const double p = studentized::phi(y);
    at(kPhi)[l] = p;
    at(kRatio)[l] = p > 0.0 ? safeExp(-y * s - 0.5 * s * s) : 0.0;
  }
  size_t mSize;
  std::vector<double> mData;
  int mSteps = 0;
};

double CmMaximumInner::logProduct(double cut, const TailLanes& lanes, double* rest) const {
  // The factors F = 1 - q with q < 1e-4 enter the log-sum by their series;
  // the others are multiplied into rest, folded into the sum before the
  // product could underflow.
  double sum = 0.0, product = 1.0;
  auto multiply = [&](double F, double m) {
    // (F > 0; a small one is taken alone, so that the product stays normal.)
    if (F < 1e-30) {
      sum += m * std::log(F);
      return;
    }
    for (double i = 0.0; i < m; ++i) {
      product *= F;
      if (product < 1e-250) sum += std::log(product), product = 1.0;
    }
  };
  const size_t stride = mModulus ? 2 : 1;
  // Each tail is evaluated only where it is used.
  const double* y = lanes.y();
  for (size_t j = 0; j < mFactors.size(); ++j) {
    const Factor& f = mFactors[j];
    const double a = y[stride * j];
    // Q(a), or Phi(a) for a < 0.
    const double smallA = a > cut ? 0.0 : lanes.tail(stride * j);
    double q = 0.0, F = 1.0;
    if (!mModulus) {
      if (a > cut) continue;
      if (a >= 0.0) {
        q = smallA;
      } else {
        F = smallA;
        if (!(F > 0.0)) return 1.0;
        q = 1.0;
      }
    } else {
      // F = Phi(a) - Phi(b), b = (-w - d z)/c <= a; Q(|b|) from the lane
      // of -b.
      const double b = -y[stride * j + 1];
      const double qa = a > cut ? 0.0 : a >= 0.0 ? smallA : 1.0 - smallA;
      // Q(-b) / Q(a) <= exp(-(b^2 - a^2)/2) = exp(-2 w d z / c^2) (z, d >= 0):
      // below 1e-17 it does not change q.
      const double gap = 0.5 * (b - a) * (b + a);
      const bool dropB = -b > cut || (gap > 40.0 && qa > 0.0);
      const double smallB = dropB ? 0.0 : lanes.tail(stride * j + 1);
      const double qb = dropB ? 0.0 : -b >= 0.0 ? smallB : 1.0 - smallB;
      q = qa + qb;
      if (q > 0.5) {
        F = b >= 0.0 ? smallB - qa : a <= 0.0 ? smallA - qb : 1.0 - q;
        if (!(F > 0.0)) return 1.0;
      }
    }
    if (q == 0.0) continue;
    if (q < 1e-4) {
      sum += f.m * log1mSmall(q);
    } else {
      multiply(q > 0.5 ? F : 1.0 - q, f.m);
    }
  }
  *rest = product;
  return sum;
}

double CmMaximumInner::zIntegral(double w) const {
  double peakLo = 0.0, peakHi = 0.0, narrowest = 1.0;
  bool first = true;
  for (const Factor& f : mFactors) {
    const double p = f.d * w;
    peakLo = first ? p : std::min(peakLo, p);
    peakHi = first ? p : std::max(peakHi, p);
    first = false;
    narrowest = std::min(narrowest, f.c / std::sqrt(1.0 + std::log(f.m)));
  }
  // Each piece phi(z) (1 - F_j^m_j) is about as wide as a normal of sd c_j
  // (the curvature of log phi(z) Q((w - l z)/c) is 1/c^2 at its peak),
  // narrowed by a power m_j: near its step F^m = exp(-m Q(u)) is a Gumbel
  // law in u = (w - l z)/c of scale 1/u*, m Q(u*) = 1, u*^2 ~ 2 log m, and
  // the trapezoidal error falls like exp(-pi^2 / (h u*)) with the step h in
  // u. The step 0.62 c/sqrt(1 + log m) keeps h u* below 0.9 for every m;
  // with sqrt(1 + log(m)/2) h u* grew towards 1.24 and cost 8e-8 relative
  // for 100 lambdas 0.99, where the z-width c/l of a factor is no wider than
  // c. The error is below 1e-13 relative for ten distinct lambdas 0.9 to 0.99
  // and 4e-10 for lambdas 0.99 to 0.9999 repeated up to 100 times (checked
  // against steps a third as large and against mpmath).
  const double h = 0.62 * narrowest;
  // A normal tail beyond cut, summed over the k factors and the z-lattice
  // (whose weights sum to about 1), is below 1e-17 of the lower bound
  // Q(|w|) of the answer: Q(cut) / Q(|w|) <= exp(-(cut^2 - w^2)/2) (cut/|w|
  // bounded), and the 1 added absorbs the ratio of the prefactors.
  const double cut = std::sqrt(w * w + 2.0 * std::log(1e17 * mK)) + 1.0;
  // The lattice is walked upwards: lane 2j (or j) holds a_j, lane 2j + 1 of
  // the modulus -b_j, the last lane z.
  const size_t stride = mModulus ? 2 : 1, zLane = stride * mFactors.size();
  TailLanes lanes(zLane);
  lanes.set(zLane, 0.0, 1.0, h);
  for (size_t j = 0; j < mFactors.size(); ++j) {
    const Factor& g = mFactors[j];
    const double slope = g.d * g.invC;
    lanes.set(stride * j, w * g.invC, -slope, -slope * h);
    if (mModulus) lanes.set(stride * j + 1, w * g.invC, slope, slope * h);
  }
  // Whether the product P = prod_j F_j^m_j at the last point is below
  // saturation (it is 0 where it vanishes).
  bool saturated = false;
  double saturation = 0.0, logSaturation = -1e300;
  auto f = [&](double z) {
    lanes.moveTo(z);
    const double density = lanes.density()[zLane];
    if (density == 0.0) return 0.0;
    double p = 1.0;
    const double s = logProduct(cut, lanes, &p);
    // P = p e^s <= min(p, e^s).
    saturated = s > 0.0 || p < saturation || s < logSaturation;
    if (s > 0.0) return density;
    // 1 - p e^s = (1 - p) + p (1 - e^s), both parts free of cancellation
    // (the factors in p are below 1 - 1e-4).
    return density * ((1.0 - p) + (s == 0.0 ? 0.0 : -p * std::expm1(s)));
  };
  // Where every factor decreases in z on the lattice walked (the modulus on
  // z >= 0: the mass of |d z + c E| < w; the maximum when every lambda is
  // positive), once their product P_k at z_k is below 1e-17, 1 - P is 1 to
  // double precision onwards and the integrand is phi(z). Below 1e-12 Q(w)
  // the rest of the lattice, taken as phi(z), is off by at most
  // P_k h sum_(i >= k) phi(z_i) <= 1.1 P_k (h <= 0.62), under 1.1e-12 of the
  // lower bound Q(w) of the answer.
  bool decreasing = true;
  for (const Factor& g : mFactors) decreasing = decreasing && g.d > 0.0;
  if (decreasing) {
    saturation = std::max(1e-17, 1e-12 * upperNormal(w));
    logSaturation = std::log(saturation);
  }
  const double decay = std::exp(-h * h);
  // The trapezoidal sum over z_i = i h, i = first .. last (the first with
  // weight 1/2 for the modulus).
  auto lattice = [&](int first, int last) {
    double sum = 0.0, density = 0.0, ratio = 0.0;
    bool flat = false;
    for (int i = first; i <= last; ++i) {
      const double z = i * h;
      if (!flat) {
        const double v = f(z);
        sum += mModulus && i == first ? 0.5 * v : v;
        // phi(z) from its lane, then by its recurrence.
        density = lanes.density()[zLane];
        flat = decreasing && saturated;
        if (flat) ratio = safeExp(-z * h - 0.5 * h * h);
      } else {
        density *= ratio;
        ratio *= decay;
        sum += density;
      }
      // The modulus: the integrand is below phi, so the rest is below
      // Q(z) <= phi(z)/z.
      if (mModulus && z >= 1.0 && density <= 1e-16 * z * h * sum) break;
    }
    return sum;
  };
  if (mModulus) {
    // Even in z: the trapezoidal rule on the whole line from z >= 0.
    // Beyond z the integrand is below phi(z), and Q(z) is below 1e-16 of
    // the lower bound 2 Q(w) of the answer at the z given.
    const double hi = std::min(peakHi + kReach, std::sqrt(w * w + 2.0 * std::log(1e16)) + 1.0);
    return 2.0 * h * lattice(0, static_cast<int>(std::ceil(hi / h)));
  }
  double lo = peakLo - kReach, hi = peakHi + kReach;
  if (w < 0.0) lo = std::min(lo, -kReach), hi = std::max(hi, kReach);
  return h * lattice(static_cast<int>(std::floor(lo / h)), static_cast<int>(std::ceil(hi / h)));
}

double CmMaximumInner::upperTail(double w) const {
  if (mModulus && w <= 0.0) return 1.0;
  if (w > 0.0 && upperBound(w) == 0.0) return 0.0;
  // P(all Y_i <= w) <= Phi(w).
  if (w < 0.0 && !(upperNormal(-w) > 1e-300)) return 1.0;
  // The lambdas 0: Phi(w)^m0 or (1 - 2 Q(w))^m0, outside the z-integral.
  double logZeros = 0.0;
  if (mZeros > 0.0) {
    double logF;
    if (mModulus) {
      logF = std::log1p(-2.0 * upperNormal(w));
    } else if (!logNormalCdf(w, &logF)) {
      return 1.0;
    }
    logZeros = mZeros * logF;
  }
  const double zeroTail = -std::expm1(logZeros);
  if (mFactors.empty()) return zeroTail;
  // 1 - F0 (1 - V) = (1 - F0) + F0 V.
  const double p = zeroTail + safeExp(logZeros) * zIntegral(w);
  return std::max(0.0, std::min(1.0, p));
}

double CmMaximumInner::upperBound(double w) const {
  if (w <= 0.0) return 1.0;
  return std::min(1.0, (mModulus ? 2.0 : 1.0) * mK * upperNormal(w));
}

double CmMaximumInner::studentizedLowerBound(double x, double df) const {
  const double t = mTCdf(std::fabs(x), df, 0.0, true);
  if (mIsNumericMissing(t)) return 0.0;
  if (mModulus) return 2.0 * t;
  return x >= 0.0 ? t : 0.5;
}

double CmRangeInner::upperTail(double w) const {
  return mNormalRangeCdf(w, mK, true);
}

double CmRangeInner::upperBound(double w) const {
  if (w <= 0.0) return 1.0;
  return std::min(1.0, 0.5 * mK * (mK - 1.0) * std::erfc(0.5 * w));
}

double CmRangeInner::studentizedLowerBound(double x, double df) const {
  const double t = mTCdf(x / kSqrt2, df, 0.0, true);
  return mIsNumericMissing(t) ? 0.0 : 2.0 * t;
}

double mGHA1(double w, int k, bool upperTail) {
  return mNormalRangeCdf(w, k, upperTail);
}

double mGHB1(double w, const std::vector<double>& distinct, const std::vector<unsigned>& counts,
             bool upperTail) {
  const double p = CmMaximumInner(distinct, counts, false).upperTail(w);
  return upperTail ? p : 1.0 - p;
}

double mGHC1(double w, const std::vector<double>& distinct, const std::vector<unsigned>& counts,
             bool upperTail) {
  const double p = CmMaximumInner(distinct, counts, true).upperTail(w);
  return upperTail ? p : 1.0 - p;
}

namespace {

using studentized::LogChi;

// The smallest t worth integrating: the chi-square lower tail there is
// below 1e-16 of a lower bound of the answer.
double lowerEnd(double lowerBound, double df) {
  const double p = lowerBound > 1e-280 ? 1e-16 * lowerBound : 1e-300;
  const double q = mChiSqInvCdf(p, df, 0.0);
  if (!mIsNumericMissing(q) && q > 0.0 && std::isfinite(q)) return 0.5 * std::log(q / df);
  // Where the quantile has no answer (df in the billions): Wilson and
  // Hilferty's cube, chi2/df ~ (1 - 2/(9 df) + z sqrt(2/(9 df)))^3, moved
  // down by a tenth of its distance from 1 for safety.
  const double z = mNormalInvCdf(p, 0.0, 1.0);
  const double v = 2.0 / (9.0 * df);
  const double base = 1.0 - v + (mIsNumericMissing(z) ? -40.0 : z) * std::sqrt(v);
  if (base > 0.0) return 1.6 * std::log(base);
  // g(t) < C e^(df t): below this it is under e^-700 of its peak.
  return -700.0 / df - 1.0;
}

// The outer rule over t = log s: 16-point Gauss-Legendre panels from the
// lower end, each as wide as the slope and curvature of log g and the scale
// of U at r = |x| e^t allow at both of its ends, until a bound on the rest
// is below 1e-17 of a lower bound of the answer. Holds the points w = x e^t
// and the weights (Gauss weight times g(t)) of the nodes where g(t) > 0.
struct OuterNodes {
  OuterNodes(const CbStudentizedInner& inner, double x, double df) {
    const LogChi g(df);
    const double logAbsX = x == 0.0 ? -745.0 : std::log(std::fabs(x));
    const double sign = x < 0.0 ? -1.0 : 1.0;
    // w = x e^t, held below 1e3 in modulus (every tail is 0 or 1 there).
    auto wAt = [&](double t) { return sign * std::exp(std::min(logAbsX + t, 7.0)); };
    auto width = [&](double t) {
      const double e2 = std::exp(2.0 * std::min(t, 300.0));
      double h = 4.0;
      const double slope = df * std::fabs(1.0 - e2);
      if (slope > 0.0) h = std::min(h, 16.0 / slope);
      const double curvature = 2.0 * df * e2;
      if (curvature > 0.0) h = std::min(h, 4.0 / std::sqrt(curvature));
      // U changes on the scale 1/r^2; beyond r = 40 it is 0 or 1.
      const double r = std::fabs(wAt(t));
      if (r > 1.0 && r < 40.0) h = std::min({h, 10.0 / (r * r), 4.0 / r});
      return h;
    };
    const double lowerBound = std::max(inner.studentizedLowerBound(x, df), 1e-300);
    double t = lowerEnd(lowerBound, df);
    // Below w = x e^-700, U(w) is U(0) to double precision: for small df,
    // whose chi density spreads over a long range of t, the mass below is
    // taken whole as U times the chi-square lower tail (its leading term
    // (y/2)^(df/2) / Gamma(df/2 + 1) below y = e^-600).
    const double flat = -700.0 - logAbsX;
    if (t < flat) {
      t = flat;
      const double logY = std::log(df) + 2.0 * t;
      const double lowerTail =
          logY < -600.0 ? safeExp(0.5 * df * (logY - std::log(2.0)) - mLogGamma(0.5 * df + 1.0))
                        : mChiSqCdf(std::exp(logY), df, 0.0, false);
      if (!mIsNumericMissing(lowerTail) && lowerTail > 0.0)
        below = lowerTail * inner.upperTail(wAt(t));
    }
    for (int panel = 0; panel < 100000; ++panel) {
      double h = width(t);
      for (int i = 0; i < 60; ++i) {
        const double far = width(t + h);
        if (far >= h) break;
        h = std::max(far, 0.5 * h);
      }
      const double c = t + 0.5 * h, half = 0.5 * h;
      for (int i = 0; i < 16; ++i) {
        const double node = c + half * (i < 8 ? kNode[i] : -kNode[i - 8]);
        const double gt = safeExp(g(node));
        if (gt == 0.0) continue;
        w.push_back(wAt(node));
        weight.push_back(half * kWeight[i % 8] * gt);
      }
      t += h;
      // U(x e^t) bounds U beyond t (U decreases in t for x > 0; the bound
      // is 1 otherwise), and P(s > e^t) <= g(t) / (df (e^(2t) - 1)) for
      // t > 0 by log-concavity of g.
      const double u = inner.upperBound(wAt(t));
      const double chiRest =
          t <= 0.0 ? 1.0 : safeExp(g(t)) / (df * std::expm1(std::min(2.0 * t, 700.0)));
      if (u * chiRest <= 1e-17 * lowerBound) break;
    }
  }
  std::vector<double> w, weight;
  double below = 0.0;  // the integral below the first panel
};

// A Chebyshev interpolant of log U, or of U itself, on [lo, hi] from the
// Chebyshev-Lobatto points (17, 33, then 65 nested).
struct ChebyshevPiece {
  double lo, hi;
  bool logarithmic;
  std::vector<double> c;
  // log U at w.
  double operator()(double w) const {
    const double y = (2.0 * w - lo - hi) / (hi - lo);
    double b1 = 0.0, b2 = 0.0;  // Clenshaw's recurrence
    for (size_t k = c.size() - 1; k >= 1; --k) {
      const double b0 = 2.0 * y * b1 - b2 + c[k];
      b2 = b1, b1 = b0;
    }
    const double v = y * b1 - b2 + c[0];
    if (logarithmic) return v;
    return v > 0.0 ? std::log(v) : -745.0;
  }
};

// Fits log U and accepts it when the last eighth (at least 4) of the
// coefficients is below 1e-13 of max(1, |log U|). log U has singularities where U has
// complex zeros, close to the axis where U is near 1 and many variables
// take part; there U itself (entire) is fitted, accepted with coefficients
// below 1e-15 of its largest value when U varies by less than a factor 20
// on the piece. 1: accepted; 0: not converged; -1: U vanishes.
int fitPiece(const CbStudentizedInner& inner, ChebyshevPiece& piece, int& budget) {
  const double mid = 0.5 * (piece.lo + piece.hi), half = 0.5 * (piece.hi - piece.lo);
  std::vector<double> u(1, 0.0);
  for (int n = 16; n <= 64; n *= 2) {
    // The new points of this level.
    const int cost = n > 16 ? n / 2 : n + 1;
    if (budget < cost) return 0;
    budget -= cost;
    // u[j] = U(mid + half cos(pi j / n)); the points of n/2 are the even j.
    std::vector<double> next(n + 1);
    for (int j = 0; j <= n; ++j) {
      next[j] =
          j % 2 == 0 && n > 16 ? u[j / 2] : inner.upperTail(mid + half * std::cos(M_PI * j / n));
      if (!(next[j] > 0.0)) return -1;
    }
    u.swap(next);
    const auto extremes = std::minmax_element(u.begin(), u.end());
    for (int logarithmic = 1; logarithmic >= 0; --logarithmic) {
      if (!logarithmic && *extremes.first < 0.05 * *extremes.second) continue;
      std::vector<double> f(u);
      double scale = *extremes.second;
      if (logarithmic) {
        scale = 1.0;
        for (double& v : f) {
          v = std::log(v);
          scale = std::max(scale, std::fabs(v));
        }
      }
      // Coefficients by the discrete cosine transform of the first kind.
      piece.c.assign(n + 1, 0.0);
      for (int k = 0; k <= n; ++k) {
        double sum = 0.0;
        for (int j = 0; j <= n; ++j) {
          const double term = f[j] * std::cos(M_PI * ((j * k) % (2 * n)) / n);
          sum += (j == 0 || j == n) ? 0.5 * term : term;
        }
        piece.c[k] = (k == 0 || k == n ? 1.0 : 2.0) * sum / n;
      }
      double tail = 0.0;
      for (int k = n - std::max(4, n / 8); k <= n; ++k)
        tail = std::max(tail, std::fabs(piece.c[k]));
      piece.logarithmic = logarithmic != 0;
      if (tail <= (logarithmic ? 1e-13 : 1e-15) * scale) return 1;
      // Far from converging at 33 points: the nodes themselves are cheaper.
      if (logarithmic && n == 32 && tail > 1e-7 * scale) return 0;
    }
  }
  return 0;
}

// log U at the outer nodes from a Chebyshev interpolant on their range of
// w: log U is analytic near the real axis, so 17 to 65 inner integrals
// serve 100 to 250 nodes. False (the caller then evaluates U at every node)
// when U vanishes on the range or the fit does not converge within as many
// inner integrals as there are nodes (log U converges slowly where U has
// complex zeros close to the range: for the modulus of many variables with
// w near 0, at small df).
bool interpolateLogTail(const CbStudentizedInner& inner, const OuterNodes& nodes,
                        std::vector<double>& logU) {
  if (nodes.w.size() < 64) return false;
  const auto range = std::minmax_element(nodes.w.begin(), nodes.w.end());
  if (!(*range.second > *range.first)) return false;
  ChebyshevPiece piece{*range.first, *range.second, true, {}};
  int budget = static_cast<int>(nodes.w.size());
  if (fitPiece(inner, piece, budget) != 1) return false;
  logU.resize(nodes.w.size());
  for (size_t i = 0; i < nodes.w.size(); ++i) logU[i] = piece(nodes.w[i]);
  return true;
}

}  // namespace

double mGLV(const CbStudentizedInner& inner, double x, double df) {
  // Beyond df = 1e15 the law differs from that of a known sigma by O(1/df).
  if (df > 1e15) return inner.upperTail(x);
  // x = 0: U(0) for every s.
  if (x == 0.0) return inner.upperTail(0.0);
  const OuterNodes nodes(inner, x, df);
  double sum = nodes.below;
  std::vector<double> logU;
  if (interpolateLogTail(inner, nodes, logU)) {
    for (size_t i = 0; i < nodes.w.size(); ++i) sum += nodes.weight[i] * safeExp(logU[i]);
  } else {
    for (size_t i = 0; i < nodes.w.size(); ++i)
      sum += nodes.weight[i] * inner.upperTail(nodes.w[i]);
  }
  return std::max(0.0, std::min(1.0, sum));
}

namespace {

// P(T > x s) by the trapezoidal rule over t = log s,
//   h sum_j g(t_j) U(x e^(t_j)),  t_j = t0 + j h,
// as for the studentized range: the integrand is analytic in a strip about
// the real axis and decays at both ends, so the rule converges geometrically
// (Trefethen and Weideman, SIAM Review 56 (2014) 385). Near its peak the
// integrand is close to a normal of variance 1/(2 df) in t (log U falls like
// -w^2/2, whose balance with log g sits at e^(2t) = df/(df + x^2), where the
// curvatures add up to 2 df), and U(x e^t) alone changes on the relative
// spread of the maximum of k variables; the step is 0.65 of the narrower
// (error below exp(-2 pi^2 / 0.65^2 / 2), about 1e-20), and at most 0.14 for
// the strip. The walk starts at that peak and goes out until the terms fall
// below 1e-12 of the sum: beyond, they fall about geometrically (g by
// e^(-df h (1 - e^(2t))) per step on the left, faster on the right), so the
// rest left out stays near 1e-12 of the answer (1.6e-12 measured against a
// cut at 1e-13 on the mpmath cases).
double trapezoidTail(const CmMaximumInner& inner, double x, double df) {
  const LogChi g(df);
  const double logAbsX = std::log(std::fabs(x));
  const double sign = x < 0.0 ? -1.0 : 1.0;
  const double spread = 0.75 / (1.0 + 1.3 * std::log(inner.size()));
  const double h = std::min({0.14, 0.46 / std::sqrt(df), 0.6 * spread});
  const double r = x / std::sqrt(df);
  const double t0 = x <= 0.0 ? 0.0 : r > 1e150 ? -std::log(r) : -0.5 * std::log1p(r * r);
  auto term = [&](double t) {
    const double logG = g(t);
    if (logG < -745.0) return 0.0;
    // Beyond w = e^7 every tail is 0 or 1.
    return safeExp(logG) * inner.upperTail(sign * std::exp(std::min(logAbsX + t, 7.0)));
  };
  double sum = term(t0);
  for (int dir = 1; dir >= -1; dir -= 2) {
    double previous = sum;
    for (int j = 1; j < 100000; ++j) {
      const double t = t0 + dir * j * h;
      const double f = term(t);
      sum += f;
      // g underflows past its mode (on either side it does so for good), or
      // U vanishes to the right.
      if (f == 0.0 && (g(t) < -745.0 || dir == 1)) break;
      if (f <= 1e-12 * sum && f <= previous) break;
      previous = f;
    }
  }
  return std::max(0.0, std::min(1.0, h * sum));
}

}  // namespace

double mMaximumTail(const CmMaximumInner& inner, double x, double df) {
  // Down to df = 4 the left walk is short (its terms fall by e^(-df h) per
  // step); below, the panels of mGLV with their closed lower part.
  if (df >= 4.0 && df <= 1e15 && x != 0.0) return trapezoidTail(inner, x, df);
  return mGLV(inner, x, df);
}

}  // namespace qel
