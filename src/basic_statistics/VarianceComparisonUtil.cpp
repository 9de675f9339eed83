// Bonett (2006), "Approximate confidence interval for standard deviation of
// nonnormal distributions", and Bonett (2006), "Robust confidence interval
// for a ratio of standard deviations", Applied Psychological Measurement 30:
// the P-values are the confidence levels at which a limit meets the
// hypothesised value, found as roots of the limit equations.
#include "basic_statistics/VarianceComparisonUtil.h"

#include <qel/distributions.h>

#include <algorithm>
#include <cfloat>
#include <cmath>

#include "interfaces/math/random_distributions_v0.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {

namespace {

bool positiveFinite(double x) {
  return x > 0.0 && x <= DBL_MAX;
}

// Roots in z live on a scale of about 1: an absolute tolerance ends the
// search near a root at 0, where a relative one never would.
void setTolerances(CmRealFunction& f) {
  f.mAbsoluteToleranceForX = 1e-14;
  f.mRelativeToleranceForX = 1e-13;
}

double upperNormalTail(double z) {
  if (std::isinf(z)) return z > 0.0 ? 0.0 : 1.0;
  return NormalCdf(z, 0.0, 1.0, true);
}

}  // namespace

CmBonettPValueFunction::CmBonettPValueFunction(bool upper, double n, double variance,
                                               double standardError, double variance0)
    : mUpper(upper),
      mN(n),
      mVariance(variance),
      mStandardError(standardError),
      mVariance0(variance0) {
  setTolerances(*this);
}

double CmBonettPValueFunction::operator()(double z) {
  const double s = mUpper ? -1.0 : 1.0;
  if (z >= mN) return s * mN * mN * mStandardError;
  if (z <= -DBL_MAX) return -DBL_MAX;
  const double m = mN - z;
  return m * (std::log(mN) - std::log(m) + std::log(mVariance) - std::log(mVariance0)) +
         s * mN * z * mStandardError;
}

// In u = n/(n - z) the sign of f is that of ln u + ln(v/h) + s n se (u - 1).
// For the lower limit (s = -1) this rises to its maximum at u = 1/(n se) and
// falls after it; the root on the falling side, z in [n - n^2 se, n), is the
// one whose limit falls as the confidence grows. For the upper limit it
// rises throughout, and u = 1 (z = 0) separates h >= v from h < v.
bool mCalcStartValues(CmBonettPValueFunction& f, double* low, double* high) {
  const double n = f.mN;
  const double nse = n * f.mStandardError;
  const double logRatio = std::log(f.mVariance) - std::log(f.mVariance0);
  if (f.mUpper) {
    const double uTop = 1.0 / nse;
    if (std::log(uTop) + logRatio - nse * (uTop - 1.0) < 0.0) return false;
    *low = n - n * nse;
    *high = n;
    return true;
  }
  if (logRatio <= 0.0) {
    *low = 0.0;
    *high = n - n * std::exp(logRatio - nse - 1.0);
    return true;
  }
  const double e = logRatio + nse;
  *low = e > 700.0 ? -DBL_MAX : n - n * std::exp(e);
  *high = 0.0;
  return true;
}

double mCalcBonettPValue(EAlternative alternative, double n, double variance, double standardError,
                         double variance0) {
  const double missing = mGetMissingValueCode();
  if (alternative != kAlternativeLess && alternative != kAlternativeNotEqual &&
      alternative != kAlternativeGreater)
    return 0.0;
  if (!(n > 1.0 && positiveFinite(n) && positiveFinite(variance) && positiveFinite(standardError) &&
        positiveFinite(variance0)))
    return missing;
  // One side: true with *p set (missing when the search fails), false when
  // the limit never reaches variance0.
  auto side = [&](bool upper, double* p) {
    CmBonettPValueFunction f(upper, n, variance, standardError, variance0);
    double low = 0.0, high = 0.0;
    if (!mCalcStartValues(f, &low, &high)) return false;
    int status = qelOk;
    const double z = mRootFinder(low, high, f, &status);
    *p = status != qelOk || mIsNumericMissing(z) ? missing : upperNormalTail(z);
    return true;
  };
  double greater = 1.0, less = 1.0;
  if (alternative != kAlternativeLess) side(true, &greater);
  if (alternative != kAlternativeGreater) side(false, &less);
  if (mIsNumericMissing(greater) || mIsNumericMissing(less)) return missing;
  if (alternative == kAlternativeGreater) return greater;
  if (alternative == kAlternativeLess) return less;
  return std::min(1.0, 2.0 * std::min(greater, less));
}

CmTwoSamplePValueFunction::CmTwoSamplePValueFunction(double n1, double n2, double standardError,
                                                     double ratio, double ratio0)
    : mN1(n1), mN2(n2), mStandardError(standardError), mRatio(ratio), mRatio0(ratio0) {
  setTolerances(*this);
}

double CmTwoSamplePValueFunction::operator()(double z) {
  // At the smaller size the limit is 0 (n2 < n1) or infinite (n1 < n2).
  if (z >= std::min(mN1, mN2)) return mN1 > mN2 ? -DBL_MAX : DBL_MAX;
  return std::log(mN1 / mN2) + std::log((mN2 - z) / (mN1 - z)) - z * mStandardError +
         std::log(mRatio) - std::log(mRatio0);
}

// f falls for z below the point where (n1 - z)(n2 - z) = (n2 - n1)/se (to
// min(n1, n2) when n1 > n2). Below 0 the size terms lie within |ln(n1/n2)|,
// which gives a point of positive f; the top of the falling branch is
// approached by halving the distance to it when n1 > n2.
double mSolvePValueEquation(double n1, double n2, double ratio, double ratio0,
                            double standardError) {
  const double missing = mGetMissingValueCode();
  if (!(positiveFinite(n1) && positiveFinite(n2) && positiveFinite(ratio) &&
        positiveFinite(ratio0) && positiveFinite(standardError)))
    return missing;
  const double logRatio = std::log(ratio) - std::log(ratio0);
  if (n1 == n2) return logRatio / standardError;
  CmTwoSamplePValueFunction f(n1, n2, standardError, ratio, ratio0);
  const double low = std::min(0.0, (logRatio - std::fabs(std::log(n1 / n2)) - 1.0) / standardError);
  double high;
  if (n1 < n2) {
    high = mPValueEquationBranchTop(n1, n2, standardError);
    if (f(high) > 0.0) return missing;
  } else {
    high = n2;
    for (double gap = 0.5 * (n2 - low); gap > 0.0; gap *= 0.5) {
      if (f(n2 - gap) < 0.0) {
        high = n2 - gap;
        break;
      }
    }
    if (high == n2) return missing;
  }
  int status = qelOk;
  const double z = mRootFinder(low, high, f, &status);
  return status == qelOk ? z : missing;
}

double mPValueEquationBranchTop(double n1, double n2, double standardError) {
  if (n1 >= n2) return n2;
  const double d = n2 - n1;
  // u = n1 - z solves u (u + d) = d / se; this form of the root does not cancel.
  const double c = d / standardError;
  return n1 - 2.0 * c / (std::sqrt(d * d + 4.0 * c) + d);
}

double mBonettLogRatioVariance(BonettCIForStdDevRatio const& first,
                               BonettCIForStdDevRatio const& second, double q) {
  const double n1 = first.n, n2 = second.n;
  const double r = first.variance / second.variance;
  const double a = (n1 - 1.0) / (n2 - 1.0);
  const double ra = r * a;
  const double scale = (n1 + n2) * (n1 - 1.0 + n2 - 1.0) / ((n1 - 1.0) * (n2 - 1.0));
  const double pooled =
      (first.kurtosis / n1 * ra * ra + second.kurtosis / n2 * q * q) / ((ra + q) * (ra + q));
  return scale * pooled - ((n1 - 3.0) / n1 / (n1 - 1.0) + (n2 - 3.0) / n2 / (n2 - 1.0));
}

CmScaledRatioLCLFunc::CmScaledRatioLCLFunc(BonettCIForStdDevRatio const& first,
                                           BonettCIForStdDevRatio const& second, double z)
    : mFirst(first), mSecond(second), mZ(z) {
  setTolerances(*this);
  const double n1 = first.n, n2 = second.n;
  mConstant = std::log(n1 / n2) + std::log((n2 - z) / (n1 - z)) + std::log(first.variance) -
              std::log(second.variance);
}

double CmScaledRatioLCLFunc::operator()(double t) {
  const double v = mBonettLogRatioVariance(mFirst, mSecond, std::exp(2.0 * t));
  if (!(v >= 0.0 && v <= DBL_MAX)) return mGetMissingValueCode();
  return mConstant - mZ * std::sqrt(v) - 2.0 * t;
}

bool mCanWeDoTwoSampleBonett(BonettCIForStdDevRatio const& first,
                             BonettCIForStdDevRatio const& second, double z) {
  for (const BonettCIForStdDevRatio* s : {&first, &second}) {
    if (!(s->n > 1.0 && s->n > z && positiveFinite(s->n) && std::isfinite(s->kurtosis) &&
          positiveFinite(s->variance)))
      return false;
  }
  return std::isfinite(z);
}

double mCalcConfLimitForRatioOfStDevs(bool upper, BonettCIForStdDevRatio const& first,
                                      BonettCIForStdDevRatio const& second, double z) {
  const double missing = mGetMissingValueCode();
  if (upper) {
    const double inverse = mCalcConfLimitForRatioOfStDevs(false, second, first, z);
    return mIsNumericMissing(inverse) || !(inverse > 0.0) ? missing : 1.0 / inverse;
  }
  if (!mCanWeDoTwoSampleBonett(first, second, z)) return missing;
  CmScaledRatioLCLFunc g(first, second, z);
  // V(q) lies below scale * max(k1/n1, k2/n2) less the size term for every
  // q, so sqrt of that bound pushes the linear term -2t past either sign.
  const double n1 = first.n, n2 = second.n;
  const double scale = (n1 + n2) * (n1 - 1.0 + n2 - 1.0) / ((n1 - 1.0) * (n2 - 1.0));
  const double top = scale * std::max(first.kurtosis / n1, second.kurtosis / n2);
  const double spread = std::fabs(z) * std::sqrt(std::max(top, 0.0));
  const double low = 0.5 * (g.mConstant - spread) - 1.0;
  const double high = 0.5 * (g.mConstant + spread) + 1.0;
  int status = qelOk;
  const double t = mRootFinder(low, high, g, &status);
  if (status != qelOk || mIsNumericMissing(t)) return missing;
  return std::exp(t);
}

bool mCalcCIForRatios(double* lower, double* upper, BonettCIForStdDevRatio& first,
                      BonettCIForStdDevRatio& second, double alpha, EConfidenceType type) {
  const double missing = mGetMissingValueCode();
  const EAlternative alternative = type == kConfidenceTwoSided    ? kAlternativeNotEqual
                                   : type == kConfidenceLowerSide ? kAlternativeGreater
                                                                  : kAlternativeLess;
  const double z = v0::NormalCritValue(alpha, alternative);
  *lower = missing;
  *upper = missing;
  bool found = true;
  if (type != kConfidenceUpperSide) {
    *lower = mCalcConfLimitForRatioOfStDevs(false, first, second, z);
    found = found && !mIsNumericMissing(*lower);
  }
  if (type != kConfidenceLowerSide) {
    *upper = mCalcConfLimitForRatioOfStDevs(true, first, second, z);
    found = found && !mIsNumericMissing(*upper);
  }
  return found;
}

}  // namespace qel
