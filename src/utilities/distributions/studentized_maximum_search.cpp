// The studentized maximum and maximum modulus: lambdas, P-values, the
// critical-value search and its brackets, and the Gauss-Hermite and normal
// tables of the classic interface.
#include <algorithm>
#include <cmath>
#include <new>

#include "qel/basic_types.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"
#include "utilities/distributions/normal_range.h"
#include "utilities/distributions/studentized_maximum_inner.h"

namespace qel {
namespace {

constexpr double kSqrt2 = 1.41421356237309504880;

// Student's t quantile at p (normal for df = inf), p from its own tail.
double tQuantile(double p, double df) {
  if (std::isinf(df)) return mNormalInvCdf(p, 0.0, 1.0);
  return mTInvCdf(p, df, 0.0);
}
// The quantile at 1 - q for a small upper tail q.
double tUpperQuantile(double q, double df) {
  const double t = tQuantile(q, df);
  return mIsNumericMissing(t) ? t : -t;
}

// Fills a bracket from two upper tails, or [1, 2] when a quantile fails.
void bracketFromTails(double qLow, double qHigh, double scale, double* lower, double* upper,
                      double df) {
  const double a = tUpperQuantile(qLow, df), b = tUpperQuantile(qHigh, df);
  if (mIsNumericMissing(a) || mIsNumericMissing(b) || !(a <= b)) {
    *lower = 1.0, *upper = 2.0;
    return;
  }
  *lower = scale * a, *upper = scale * b;
}

// Checks and merges the lambdas; false for a null array, count 0, a lambda
// not inside (-1, 1), df not positive, or no memory.
bool prepare(const double* lambdas, unsigned count, double df, std::vector<double>& distinct,
             std::vector<unsigned>& counts) {
  if (lambdas == nullptr || count == 0 || std::isnan(df) || !(df > 0.0)) return false;
  for (unsigned i = 0; i < count; ++i)
    if (std::isnan(lambdas[i]) || !(std::fabs(lambdas[i]) < 1.0)) return false;
  return ConsolidateLambdas(lambdas, count, distinct, counts) == 0;
}

double tail(const CmMaximumInner& inner, double x, double df, bool modulus) {
  if (modulus && x <= 0.0) return 1.0;
  if (std::isinf(x)) return x > 0.0 ? 0.0 : 1.0;
  return mMaximumTail(inner, x, df);
}

double pValue(double x, double df, const double* lambdas, unsigned count, bool modulus) {
  std::vector<double> distinct;
  std::vector<unsigned> counts;
  if (std::isnan(x) || !prepare(lambdas, count, df, distinct, counts))
    return mGetMissingValueCode();
  // One variable: Student's t.
  if (count == 1 && !std::isinf(df) && x > 0.0) {
    const double t = mTCdf(x, df, 0.0, true);
    return mIsNumericMissing(t) ? t : std::min(1.0, (modulus ? 2.0 : 1.0) * t);
  }
  return tail(CmMaximumInner(distinct, counts, modulus), x, df, modulus);
}

// For alpha < 1/2 the root is positive (P(max > 0) >= P(Y_1 > 0) = 1/2):
// the secant method on log P against log x, as for the studentized range,
// from the Bonferroni point t_df(1 - alpha/k) (alpha/(2k) per tail for the
// modulus), which lies above the root, and a step 5 percent below it; to
// 1e-9 in log x, far below the two-decimal rounding.
double solveOnLogScale(const CmMaximumInner& inner, double alpha, double df, int k, bool modulus) {
  const double target = std::log(alpha);
  auto f = [&](double y) {
    const double p = tail(inner, std::exp(y), df, modulus);
    return (p > 0.0 ? std::log(p) : -745.0) - target;
  };
  double t0 = tUpperQuantile((modulus ? 0.5 : 1.0) * alpha / k, std::min(df, 1e10));
  if (mIsNumericMissing(t0) || !(t0 > 0.0 && t0 < 1e300)) t0 = 1.0;
  const double y0 = std::log(t0);
  return mSolveOnLogScale(f, -1, y0, y0 - 0.05, 1.0, 1e-11, 1e-9);
}

double critValue(double alpha, double df, const double* lambdas, unsigned count, bool modulus) {
  std::vector<double> distinct;
  std::vector<unsigned> counts;
  if (std::isnan(alpha) || !(alpha > 0.0 && alpha < 1.0) ||
      !prepare(lambdas, count, df, distinct, counts))
    return mGetMissingValueCode();
  if (count == 1) return tUpperQuantile(modulus ? 0.5 * alpha : alpha, df);
  const CmMaximumInner inner(distinct, counts, modulus);
  const int k = static_cast<int>(std::min<unsigned>(count, 1u << 30));
  double lower, upper;
  if (modulus) {
    mBDMCC2(k, df, 1.0 - alpha, &lower, &upper);
  } else {
    mBDMCB1(k, df, 1.0 - alpha, &lower, &upper);
  }
  double x = 0.0;
  if (alpha < 0.5) {
    x = solveOnLogScale(inner, alpha, df, k, modulus);
  } else {
    x = mMRGFLS([&](double v) { return tail(inner, v, df, modulus); }, alpha, lower, upper);
  }
  // The modulus tail is 1 at x <= 0.
  if (modulus) x = std::max(x, 0.0);
  return mNearestInteger(100.0 * x) / 100.0;
}

}  // namespace

int ConsolidateLambdas(const double* values, unsigned count, std::vector<double>& distinct,
                       std::vector<unsigned>& counts) {
  distinct.clear();
  counts.clear();
  try {
    std::vector<double> sorted(values, values + count);
    // NaN last, so that the order stays strict.
    std::sort(sorted.begin(), sorted.end(),
              [](double a, double b) { return a < b || (!std::isnan(a) && std::isnan(b)); });
    for (double v : sorted) {
      if (!distinct.empty() && distinct.back() == v) {
        ++counts.back();
      } else {
        distinct.push_back(v);
        counts.push_back(1);
      }
    }
  } catch (const std::bad_alloc&) {
    distinct.clear();
    counts.clear();
    return qelFailOutOfMemory;
  }
  return 0;
}

int mConsolidateLambdas(const std::vector<double>& values, std::vector<double>& distinct,
                        std::vector<unsigned>& counts) {
  return ConsolidateLambdas(values.data(), static_cast<unsigned>(values.size()), distinct, counts);
}

bool mGHArrayInit(double* nodes, double* weights) {
  std::vector<double> x, w;
  if (!mGaussHermiteQuadratureWeights(48, x, w, false) || x.size() != 48 || w.size() != 48)
    return false;
  std::copy(x.begin(), x.end(), nodes);
  std::copy(w.begin(), w.end(), weights);
  return true;
}

void mNCDFV(int count, const double* z, double* out) {
  for (int i = 0; i < count; ++i) out[i] = 0.5 * std::erfc(-z[i] / kSqrt2);
}

void mBDMCA2(int k, double df, double p, double* lower, double* upper) {
  // |Y_1 - Y_2| / sqrt(2) is one pair; Sidak over the k (k - 1)/2 pairs.
  const double pairs = 0.5 * k * (k - 1.0);
  const double perPair = -std::expm1(std::log(p) / pairs);
  bracketFromTails(0.5 * (1.0 - p), 0.5 * perPair, kSqrt2, lower, upper, df);
}

void mBDMCB1(int k, double df, double p, double* lower, double* upper) {
  // One variable below; Bonferroni over k above.
  bracketFromTails(1.0 - p, (1.0 - p) / k, 1.0, lower, upper, df);
}

void mBDMCC2(int k, double df, double p, double* lower, double* upper) {
  // One variable below; above, Sidak's inequality for the |Y_i| under any
  // correlation (Z. Sidak, JASA 62, 1967).
  const double perVariable = -std::expm1(std::log(p) / k);
  bracketFromTails(0.5 * (1.0 - p), 0.5 * perVariable, 1.0, lower, upper, df);
}

double mMRGFLS(const std::function<double(double)>& upperTail, double alpha, double lower,
               double upper) {
  const double target = std::log(alpha);
  auto f = [&](double x) {
    const double p = upperTail(x);
    return (p > 0.0 ? std::log(p) : -745.0) - target;
  };
  double lo = lower, hi = upper;
  double step = std::max(hi - lo, 0.25);
  double flo = f(lo), fhi = f(hi);
  for (int i = 0; i < 60 && flo < 0.0; ++i) {
    hi = lo, fhi = flo;
    lo -= step, flo = f(lo);
    step *= 2.0;
  }
  for (int i = 0; i < 60 && fhi > 0.0; ++i) {
    lo = hi, flo = fhi;
    hi += step, fhi = f(hi);
    step *= 2.0;
  }
  int side = 0;
  for (int i = 0; i < 200 && hi - lo > 1e-10 * std::max(1.0, std::fabs(hi)); ++i) {
    // Bisection where the tail is flat to double precision.
    double x = fhi != flo ? hi - fhi * (hi - lo) / (fhi - flo) : 0.5 * (lo + hi);
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

double mStudentizedMaximumPValue(double x, double df, const double* lambdas, unsigned count) {
  return pValue(x, df, lambdas, count, false);
}
double mStudentizedMaximumPValue(double x, double df, const std::vector<double>& lambdas) {
  return pValue(x, df, lambdas.data(), static_cast<unsigned>(lambdas.size()), false);
}
double mStudentizedMaximumCritValue(double alpha, double df, const double* lambdas,
                                    unsigned count) {
  return critValue(alpha, df, lambdas, count, false);
}
double mStudentizedMaximumCritValue(double alpha, double df, const std::vector<double>& lambdas) {
  return critValue(alpha, df, lambdas.data(), static_cast<unsigned>(lambdas.size()), false);
}
double mStudentizedMaximumModulusPValue(double x, double df, const double* lambdas,
                                        unsigned count) {
  return pValue(x, df, lambdas, count, true);
}
double mStudentizedMaximumModulusPValue(double x, double df, const std::vector<double>& lambdas) {
  return pValue(x, df, lambdas.data(), static_cast<unsigned>(lambdas.size()), true);
}
double mStudentizedMaximumModulusCritValue(double alpha, double df, const double* lambdas,
                                           unsigned count) {
  return critValue(alpha, df, lambdas, count, true);
}
double mStudentizedMaximumModulusCritValue(double alpha, double df,
                                           const std::vector<double>& lambdas) {
  return critValue(alpha, df, lambdas.data(), static_cast<unsigned>(lambdas.size()), true);
}

}  // namespace qel
