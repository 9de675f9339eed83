// The studentized range: P-value, critical value and the 5 percent table.
//
// The upper tail is integrated over t = log s, where the density of s,
//   g(t) = s f(s) = 2 (df/2)^(df/2) exp(df t - df e^(2t)/2) / Gamma(df/2),
// is smooth and log-concave for every df > 0 (no endpoint singularity for
// df < 1), and
//   P(Q > q) = int g(t) U(q e^t) dt,   U = 1 - W_k, the normal range upper tail
// computed in its own right by mNormalRangeCdf. Below the point a where
// W_k(q e^a) <= k (q e^a phi(0))^(k-1) < 1e-13, U is 1 to that accuracy and the
// piece is the chi-square lower tail P(chi2_df < df e^(2a)); a is raised to
// where that piece is below 1e-16 of a lower bound of the answer. Above a the
// integral is taken by 16-point Gauss-Legendre panels whose width follows the
// local scales of g (1/sqrt(df)) and of U (2/r^2 at r = q e^t), until a
// log-concavity bound on the rest falls below 1e-17 of the sum. Against
// mpmath double integrals this holds 1e-9 absolute and 1e-7 relative where the
// single 48-point rules over a chi-square quantile range with a linear normal
// table (a fixed, low-accuracy design) are off by up to 1e-3.
#include "utilities/distributions/studentized_range.h"

#include <algorithm>
#include <cmath>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/normal_range.h"
#include "utilities/special_functions/transcendental.h"

namespace qel {
namespace {

constexpr double kPhi0 = 0.39894228040143267794;
constexpr double kSqrt2 = 1.41421356237309504880;

const double kTukeyTable[60][8] = {
#include "utilities/distributions/tukey_table.inc"
};

// log g(t) for the chi distribution of s in the variable t = log s.
struct LogChi {
  explicit LogChi(double df)
      : df(df), c(std::log(2.0) + 0.5 * df * std::log(0.5 * df) - mLogGamma(0.5 * df)) {}
  double operator()(double t) const {
    const double e2 = 2.0 * t > 700.0 ? 1e300 : std::exp(2.0 * t);
    return c + df * t - 0.5 * df * e2;
  }
  double df, c;
};

double safeExp(double x) {
  return x < -745.0 ? 0.0 : std::exp(std::min(x, 700.0));
}

// int over [lo, hi] of g(t) U(q e^t) dt by one 16-point Gauss-Legendre rule.
class OuterIntegrand : public CmRealFunction {
 public:
  OuterIntegrand(const LogChi& g, double q, int k) : mG(g), mQ(q), mK(k) {}
  double operator()(double t) override {
    const double gt = safeExp(mG(t));
    if (gt == 0.0) return 0.0;
    return gt * mNormalRangeCdf(mQ * std::exp(t), mK, true);
  }

 private:
  const LogChi& mG;
  double mQ;
  int mK;
};

double upperTail(double q, int k, double df) {
  const LogChi g(df);
  // Where the normal range cdf is below 1e-13 (W_k(r) <= k (r phi(0))^(k-1)).
  double a = std::log(std::pow(1e-13 / k, 1.0 / (k - 1)) / (q * kPhi0));
  // The tail is at least L = U(q) P(s <= 1); below the chi-square quantile
  // at 1e-16 L lies less mass of s than 1e-16 of the answer, so the panels
  // start there when it lies above a.
  const double lowerBound = mNormalRangeCdf(q, k, true) * mChiSqCdf(df, df, 0.0, false);
  if (lowerBound > 1e-290) {
    const double x = mChiSqInvCdf(1e-16 * lowerBound, df, 0.0);
    if (!mIsNumericMissing(x) && x > 0.0) a = std::max(a, 0.5 * std::log(x / df));
  }
  // P(chi2_df < x); below x = e^-600 its leading term (x/2)^(df/2) / Gamma(df/2 + 1).
  const double logX = std::log(df) + 2.0 * a;
  double sum = logX < -600.0
                   ? safeExp(0.5 * df * (logX - std::log(2.0)) - mLogGamma(0.5 * df + 1.0))
                   : mChiSqCdf(std::exp(logX), df, 0.0, false);
  OuterIntegrand f(g, q, k);
  const double sqrtDf = std::sqrt(df);
  double t = a;
  for (int panel = 0; panel < 100000; ++panel) {
    const double r = q * std::exp(std::min(t, 300.0));
    const double h = std::min({1.0, 1.0 / sqrtDf, 2.0 / (r * r)});
    sum += mGaussianIntegration(t, t + h, f, 16);
    t += h;
    // Both factors decrease beyond the peak of g at t = 0, so the rest is at
    // most U(q e^t) P(s > e^t), and for t > 0 (g log-concave) at most
    // U(q e^t) g(t) / (df (e^(2t) - 1)).
    const double u = mNormalRangeCdf(q * std::exp(std::min(t, 300.0)), k, true);
    const double chiRest = t <= 0.0 ? 1.0 : safeExp(g(t)) / (df * std::expm1(2.0 * t));
    const double rest = u == 0.0 ? 0.0 : u * chiRest;
    if (rest <= 1e-17 * sum) break;
  }
  return std::max(0.0, std::min(1.0, sum));
}

bool badArguments(int k, double df) {
  return k < 2 || std::isnan(df) || !(df > 0.0);
}

// The q with P(Q > q) = alpha: Illinois regula falsi on log P(q) - log alpha,
// bracketed by doubling, to a relative width of 1e-10 (far below the
// two-decimal rounding).
double solveUpper(double alpha, int k, double df) {
  const double target = std::log(alpha);
  auto f = [&](double q) {
    const double p = upperTail(q, k, df);
    return (p > 0.0 ? std::log(p) : -745.0) - target;
  };
  double lo = 1.0, hi = 2.0;
  double flo = f(lo), fhi = f(hi);
  for (int i = 0; i < 60 && flo < 0.0; ++i) {
    hi = lo, fhi = flo;
    lo *= 0.5, flo = f(lo);
  }
  for (int i = 0; i < 1100 && fhi > 0.0; ++i) {
    lo = hi, flo = fhi;
    hi *= 2.0, fhi = f(hi);
  }
  int side = 0;
  for (int i = 0; i < 200 && hi - lo > 1e-10 * hi; ++i) {
    double x = hi - fhi * (hi - lo) / (fhi - flo);
    if (!(x > lo && x < hi)) x = 0.5 * (lo + hi);
    const double fx = f(x);
    if (fx == 0.0) return x;
    if (fx > 0.0) {
      lo = x, flo = fx;
      if (side == -1) fhi *= 0.5;
      side = -1;
    } else {
      hi = x, fhi = fx;
      if (side == 1) flo *= 0.5;
      side = 1;
    }
  }
  return 0.5 * (lo + hi);
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
  return upperTail(q, k, df);
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
  q = std::isinf(df) ? mNormalRangeCritValue(alpha, k) : solveUpper(alpha, k, df);
  return mNearestInteger(100.0 * q) / 100.0;
}

}  // namespace qel
