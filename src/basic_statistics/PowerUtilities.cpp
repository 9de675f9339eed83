// Power formulas of the one- and two-sample designs.
//
// t test: the power is P(T' > t) + P(T' < -t) for a noncentral t variable T'
// with the test's degrees of freedom and the noncentrality of the effect,
// each tail taken from the kernel in its own right. Proportions and Poisson
// rates use the normal approximation with separate standard errors under
// the null and the alternative (Fleiss, Levin and Paik, Statistical Methods
// for Rates and Proportions, 3rd ed., 2003, sec. 4.2). Variances: the exact
// chi-square and F rules, Bonett's log-ratio test (Bonett, Comput. Stat.
// Data Anal. 50 (2006) 775-782), and the normal approximation to Levene's
// test on absolute deviations, whose mean for a normal population is
// sigma sqrt(2 / pi) and variance sigma^2 (1 - 2 / pi).
#include "basic_statistics/PowerUtilities.h"

#include <algorithm>
#include <cmath>
#include <stdexcept>

#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"

namespace qel {

namespace {

const double kMissing = mGetMissingValueCode();

bool isLevel(double level) {
  return level > 0.0 && level < 1.0;
}

bool isFinite(double x) {
  return std::isfinite(x) && !mIsNumericMissing(x);
}

// The largest noncentrality the noncentral t kernel is asked for.
double maxNoncentrality() {
  return std::sqrt(2.0 * mGetMaxInteger());
}

double upperNormal(double z) {
  return mNormalCdf(z, 0.0, 1.0, true);
}

double lowerNormal(double z) {
  return mNormalCdf(z, 0.0, 1.0, false);
}

// The sum of the parts that the alternative asks for: the upper part for a
// non-negative alternative, the lower part for a non-positive one. A missing
// part makes the power missing.
double sumOfParts(EAlternative alternative, double upper, double lower) {
  double power = 0.0;
  if (alternative >= 0) {
    if (!isFinite(upper)) return kMissing;
    power += upper;
  }
  if (alternative <= 0) {
    if (!isFinite(lower)) return kMissing;
    power += lower;
  }
  return std::min(power, 1.0);
}

// P(T > t) (upper) or P(T < -t) for the noncentral t, t > 0. The tail on
// the side away from the noncentrality is integrated in its own right when
// it is the whole power (a one-sided test) or when df is fractional, where
// the kernel loses its relative (and, for fractional df, absolute) accuracy;
// otherwise the kernel gives it, in its own tail.
double noncentralTTail(double t, double df, double ncp, bool upper, EAlternative alternative) {
  const bool opposite = upper ? ncp < 0.0 : ncp > 0.0;
  if (opposite && t > 0.0 && (alternative != 0 || df != std::floor(df))) {
    return mNoncentralTOppositeTail(t, df, std::fabs(ncp));
  }
  return upper ? mTCdf(t, df, ncp, true) : mTCdf(-t, df, ncp, false);
}

// The t rule: tails of the noncentral t beyond the critical values +-t.
double noncentralTPower(EAlternative alternative, double df, double ncp, double level) {
  if (!(df > 0.0) || !isFinite(ncp) || std::fabs(ncp) > maxNoncentrality()) return kMissing;
  const double t = mTCritValue(level, df, alternative, 1);
  if (!isFinite(t)) return kMissing;
  const double upper = alternative >= 0 ? noncentralTTail(t, df, ncp, true, alternative) : 0.0;
  const double lower = alternative <= 0 ? noncentralTTail(t, df, ncp, false, alternative) : 0.0;
  return sumOfParts(alternative, upper, lower);
}

// The ratio of variances: squared when given as a ratio of sigmas; missing
// at or below 1e-30.
double varianceRatio(double ratio, bool ratioOfSigmas) {
  if (!(ratio > 0.0) || !isFinite(ratio)) return kMissing;
  const double r = ratioOfSigmas ? mRaiseToPower(ratio, 2.0, true) : ratio;
  return r < 1e-30 || !isFinite(r) ? kMissing : r;
}

bool validSizes(int n1, int n2, bool oneSample) {
  return n1 >= 2 && (oneSample || n2 >= 2);
}

// The reference distribution of the chi-square and F rules.
struct ReferenceDistribution {
  bool chiSquare;
  double d1, d2;
  double quantile(double p) const {
    return chiSquare ? mChiSqInvCdf(p, d1, 0.0) : mFInvCdf(p, d1, d2, 0.0);
  }
  // The F kernel has no answer far out (x near 1e9 and beyond); there the
  // tails come from the beta distribution of z = d2 / (d2 + d1 x), whose
  // lower tail is the F upper tail (computed without cancellation).
  double tail(double x, bool upper) const {
    if (chiSquare) return mChiSqCdf(x, d1, 0.0, upper);
    const double p = mFCdf(x, d1, d2, 0.0, upper);
    if (!mIsNumericMissing(p) || !(x > 0.0)) return p;
    return mBetaCdf(d2 / (d2 + d1 * x), d2 / 2.0, d1 / 2.0, !upper);
  }
};

double chiSquareFPower(EAlternative alternative, const ReferenceDistribution& g, double r,
                       double level) {
  const double a = alternative == 0 ? level / 2.0 : level;
  double upper = 0.0, lower = 0.0;
  if (alternative >= 0) {
    const double q = g.quantile(1.0 - a);
    upper = isFinite(q) ? g.tail(q / r, true) : kMissing;
  }
  if (alternative <= 0) {
    const double q = g.quantile(a);
    lower = isFinite(q) ? g.tail(q / r, false) : kMissing;
  }
  return sumOfParts(alternative, upper, lower);
}

}  // namespace

double mReduceUpperEnd(double x) {
  return x * (1.0 - mGetEps(false));
}

double mGetTotalNumberOfCells(const std::vector<int>& levels) {
  double cells = 1.0;
  for (int level : levels) cells *= level;
  return cells;
}

double mGetTotalSamplesSize(int replicates, const std::vector<int>& levels) {
  return replicates * mGetTotalNumberOfCells(levels);
}

int mSampleSizeFromDouble(double x) {
  if (!isFinite(x) || x < 0.0 || x >= 2147483648.0) return -1;
  return static_cast<int>(x);
}

double mTOneCalcOnePower(EAlternative alternative, int n, double effect, double sigma, double level,
                         bool oneSample, bool useT, double noncentrality) {
  try {
    if (n < 1 || !isLevel(level)) return kMissing;
    double ncp = noncentrality;
    if (mIsNumericMissing(ncp)) {
      if (!(sigma > 0.0) || !isFinite(sigma) || !isFinite(effect)) return kMissing;
      const double scale = oneSample ? std::sqrt(static_cast<double>(n)) : std::sqrt(n / 2.0);
      ncp = effect / sigma * scale;
    }
    if (!isFinite(ncp)) return kMissing;
    if (useT) {
      const double df = oneSample ? n - 1.0 : 2.0 * n - 2.0;
      return noncentralTPower(alternative, df, ncp, level);
    }
    const double c = mNormalCritValue(level, alternative);
    if (!isFinite(c)) return kMissing;
    const double upper = alternative >= 0 ? upperNormal(c - ncp) : 0.0;
    const double lower = alternative <= 0 ? lowerNormal(-(ncp + c)) : 0.0;
    return sumOfParts(alternative, upper, lower);
  } catch (const std::runtime_error&) {
    return kMissing;
  }
}

double mPOneCalcOnePower(EAlternative alternative, int n, double critical, double effect,
                         double null, bool oneSample) {
  try {
    if (n < 1 || !isFinite(critical) || !isFinite(effect) || !(null >= 0.0 && null <= 1.0)) {
      return kMissing;
    }
    const double p1 = null + effect;
    if (!(p1 >= 0.0 && p1 <= 1.0)) return kMissing;
    double v1 = p1 * (1.0 - p1);
    double v0 = null * (1.0 - null);
    if (!oneSample) {
      const double pbar = (null + p1) / 2.0;
      v1 += v0;
      v0 = 2.0 * pbar * (1.0 - pbar);
    }
    const double s1 = std::sqrt(v1 / n);
    const double s0 = std::sqrt(v0 / n);
    if (mEqualWithinFuzz(s1, 0.0, 0.0)) return kMissing;
    const double upper = alternative >= 0 ? upperNormal((critical * s0 - effect) / s1) : 0.0;
    const double lower = alternative <= 0 ? lowerNormal(-(effect + critical * s0) / s1) : 0.0;
    return sumOfParts(alternative, upper, lower);
  } catch (const std::runtime_error&) {
    return kMissing;
  }
}

double mPoissonPower(EAlternative alternative, int n, double rate, double effect, double level,
                     const std::vector<double>& lengths, bool oneSample) {
  try {
    if (n < 1 || !isLevel(level) || !(rate > 0.0) || !isFinite(rate) || !isFinite(effect)) {
      return kMissing;
    }
    if (lengths.empty() || (!oneSample && lengths.size() < 2)) return kMissing;
    const double r1 = rate + effect;
    if (r1 < 1e-30) return kMissing;
    const double l1 = lengths[0];
    const double l2 = oneSample ? 1.0 : lengths[1];
    if (!(l1 > 0.0) || !(l2 > 0.0) || !isFinite(l1) || !isFinite(l2)) return kMissing;
    double s0, s1;
    if (oneSample) {
      s0 = std::sqrt(rate / (l1 * n));
      s1 = std::sqrt(r1 / (l1 * n));
    } else {
      s0 = std::sqrt((rate * l2 + l1 * r1) / (l1 + l2) / n * (1.0 / l1 + 1.0 / l2));
      s1 = std::sqrt((rate / l2 + r1 / l1) / n);
    }
    if (!(s1 > 0.0) || !isFinite(s0) || !isFinite(s1)) return kMissing;
    const double z = mNormalCritValue(level, alternative);
    if (!isFinite(z)) return kMissing;
    if (alternative < 0) return upperNormal((z * s0 + effect) / s1);
    const double upper = upperNormal((z * s0 - effect) / s1);
    const double lower = alternative == 0 ? lowerNormal(-(z * s0 + effect) / s1) : 0.0;
    return sumOfParts(alternative, upper, lower);
  } catch (const std::runtime_error&) {
    return kMissing;
  }
}

double mChiSquareFVariancePower(EAlternative alternative, int n1, int n2, double ratio,
                                double level, bool oneSample, bool ratioOfSigmas) {
  try {
    if (!validSizes(n1, n2, oneSample) || !isLevel(level)) return kMissing;
    const double r = varianceRatio(ratio, ratioOfSigmas);
    if (mIsNumericMissing(r)) return kMissing;
    const ReferenceDistribution g{oneSample, n1 - 1.0, n2 - 1.0};
    return chiSquareFPower(alternative, g, r, level);
  } catch (const std::runtime_error&) {
    return kMissing;
  }
}

double mBonettTestPower(EAlternative alternative, int n1, int n2, double ratio, double level,
                        bool oneSample, bool ratioOfSigmas, double kurtosis) {
  try {
    if (!validSizes(n1, n2, oneSample) || !isLevel(level) || !isFinite(kurtosis)) return kMissing;
    const double r = varianceRatio(ratio, ratioOfSigmas);
    if (mIsNumericMissing(r)) return kMissing;
    const double m1 = n1, m2 = n2;
    double v;
    if (oneSample) {
      v = (kurtosis + 2.0 + 3.0 / m1) / (m1 - 1.0);
    } else {
      v = ((kurtosis + 3.0) - (m1 - 3.0) / m1) / (m1 - 1.0) +
          ((kurtosis + 3.0) - (m2 - 3.0) / m2) / (m2 - 1.0);
    }
    if (!(v > mGetEps(false))) return kMissing;
    const double w = std::sqrt(v);
    const double c = mNormalCritValue(level, alternative);
    if (!isFinite(c)) return kMissing;
    const double shift = std::log(r) / w;
    const double upper = alternative >= 0 ? upperNormal(c - shift) : 0.0;
    const double lower = alternative <= 0 ? lowerNormal(-c - shift) : 0.0;
    return sumOfParts(alternative, upper, lower);
  } catch (const std::runtime_error&) {
    return kMissing;
  }
}

double mLeveneTestPower(EAlternative alternative, int n1, int n2, double ratio, double level,
                        bool ratioOfSigmas) {
  try {
    if (n1 < 1 || n2 < 1 || n1 + n2 <= 2 || !isLevel(level)) return kMissing;
    if (!(ratio > 0.0) || !isFinite(ratio)) return kMissing;
    const double s = ratioOfSigmas ? ratio : std::sqrt(ratio);
    const double v = s * s;
    if (v < 1e-30 || !isFinite(v)) return kMissing;
    const double g = std::sqrt(mGetPi() / 2.0 - 1.0);
    const double q = static_cast<double>(n1) / n2;
    const double f = std::sqrt((q + v) / (v * q + 1.0));
    const double t = mTCritValue(level, n1 + n2 - 2.0, alternative, 1);
    if (!isFinite(t)) return kMissing;
    const double m = (s - 1.0) / (g * std::sqrt(v / n1 + 1.0 / n2));
    const double upper = alternative >= 0 ? upperNormal(t / f - m) : 0.0;
    const double lower = alternative <= 0 ? lowerNormal(-t / f - m) : 0.0;
    return sumOfParts(alternative, upper, lower);
  } catch (const std::runtime_error&) {
    return kMissing;
  }
}

double mVariancePower(EAlternative alternative, int n1, int n2, double ratio, double level,
                      bool oneSample, bool ratioOfSigmas, ETestMethod method, double kurtosis) {
  switch (method) {
    case kVarianceBonett:
      return mBonettTestPower(alternative, n1, n2, ratio, level, oneSample, ratioOfSigmas,
                              kurtosis);
    case kVarianceLevene:
      if (!oneSample) return mLeveneTestPower(alternative, n1, n2, ratio, level, ratioOfSigmas);
      return mChiSquareFVariancePower(alternative, n1, n2, ratio, level, oneSample, ratioOfSigmas);
    case kVarianceChiSquareOrF:
      return mChiSquareFVariancePower(alternative, n1, n2, ratio, level, oneSample, ratioOfSigmas);
  }
  return kMissing;
}

double mCalcWelchDF(int n1, int n2, double s1, double s2) {
  if (n1 < 2 || n2 < 2) return kMissing;
  const double a = s1 * s1 / n1;
  const double b = s2 * s2 / n2;
  const double denominator = a * a / (n1 - 1.0) + b * b / (n2 - 1.0);
  if (!(denominator > 0.0) || !isFinite(denominator)) return kMissing;
  const double df = (a + b) * (a + b) / denominator;
  return isFinite(df) ? df : kMissing;
}

double mCalcWelchTTestPower(EAlternative alternative, int n1, int n2, double difference, double s1,
                            double s2, double level) {
  try {
    if (!isLevel(level) || !(s1 > 0.0) || !(s2 > 0.0) || !isFinite(s1) || !isFinite(s2) ||
        !isFinite(difference)) {
      return kMissing;
    }
    const double df = mCalcWelchDF(n1, n2, s1, s2);
    if (mIsNumericMissing(df)) return kMissing;
    const double ncp = difference / std::sqrt(s1 * s1 / n1 + s2 * s2 / n2);
    return noncentralTPower(alternative, df, ncp, level);
  } catch (const std::runtime_error&) {
    return kMissing;
  }
}

// --- Function objects --------------------------------------------------------

CmPowerFunction::CmPowerFunction(double target, bool solveForSampleSize)
    : mSolveForSampleSize(solveForSampleSize) {
  mTarget = target;
  mIntegerValued = solveForSampleSize;
}

double CmPowerFunction::operator()(double x) {
  if (mSolveForSampleSize && mSampleSizeFromDouble(x) < 0) return kMissing;
  const double power = mPowerAt(x);
  return mIsNumericMissing(power) ? power : power - mTarget;
}

CmTPower::CmTPower(EAlternative alternative, int n, double effect, double sigma, double level,
                   bool oneSample, bool useT, double target, bool solveForSampleSize)
    : CmPowerFunction(target, solveForSampleSize),
      mAlternative(alternative),
      mN(n),
      mEffect(effect),
      mSigma(sigma),
      mLevel(level),
      mOneSample(oneSample),
      mUseT(useT),
      mNoncentrality(kMissing) {}

double CmTPower::mPowerAt(double x) const {
  if (!mSolveForSampleSize) {
    return mTOneCalcOnePower(mAlternative, mN, x, mSigma, mLevel, mOneSample, mUseT,
                             mNoncentrality);
  }
  const int n = mSampleSizeFromDouble(x);
  double ncp = mNoncentrality;
  if (!mIsNumericMissing(ncp)) ncp = std::sqrt(static_cast<double>(n)) * mEffect / mSigma;
  return mTOneCalcOnePower(mAlternative, n, mEffect, mSigma, mLevel, mOneSample, mUseT, ncp);
}

CmPPower::CmPPower(EAlternative alternative, int n, double critical, double effect, double null,
                   bool oneSample, double target, bool solveForSampleSize)
    : CmPowerFunction(target, solveForSampleSize),
      mAlternative(alternative),
      mN(n),
      mCritical(critical),
      mEffect(effect),
      mNull(null),
      mOneSample(oneSample) {}

double CmPPower::mPowerAt(double x) const {
  if (mSolveForSampleSize) {
    return mPOneCalcOnePower(mAlternative, mSampleSizeFromDouble(x), mCritical, mEffect, mNull,
                             mOneSample);
  }
  return mPOneCalcOnePower(mAlternative, mN, mCritical, x, mNull, mOneSample);
}

CmVariancePower::CmVariancePower(EAlternative alternative, int n, double ratio, double level,
                                 bool oneSample, bool ratioOfSigmas, ETestMethod method,
                                 double kurtosis, double target, bool solveForSampleSize)
    : CmPowerFunction(target, solveForSampleSize),
      mAlternative(alternative),
      mN(n),
      mRatio(ratio),
      mLevel(level),
      mOneSample(oneSample),
      mRatioOfSigmas(ratioOfSigmas),
      mMethod(method),
      mKurtosis(kurtosis) {}

double CmVariancePower::mPowerAt(double x) const {
  const int n = mSolveForSampleSize ? mSampleSizeFromDouble(x) : mN;
  const double ratio = mSolveForSampleSize ? mRatio : x;
  return mVariancePower(mAlternative, n, n, ratio, mLevel, mOneSample, mRatioOfSigmas, mMethod,
                        mKurtosis);
}

CmPoissonPower::CmPoissonPower(EAlternative alternative, int n, double rate, double effect,
                               double level, const std::vector<double>& lengths, bool oneSample,
                               double target, bool solveForSampleSize)
    : CmPowerFunction(target, solveForSampleSize),
      mAlternative(alternative),
      mN(n),
      mRate(rate),
      mEffect(effect),
      mLevel(level),
      mLengths(lengths),
      mOneSample(oneSample) {}

double CmPoissonPower::mPowerAt(double x) const {
  if (mSolveForSampleSize) {
    return mPoissonPower(mAlternative, mSampleSizeFromDouble(x), mRate, mEffect, mLevel, mLengths,
                         mOneSample);
  }
  return mPoissonPower(mAlternative, mN, mRate, x, mLevel, mLengths, mOneSample);
}

CmWelchTPower::CmWelchTPower(EAlternative alternative, int n1, int n2, double difference, double s1,
                             double s2, double level, double target, bool solveForSampleSize)
    : CmPowerFunction(target, solveForSampleSize),
      mAlternative(alternative),
      mN1(n1),
      mN2(n2),
      mDifference(difference),
      mS1(s1),
      mS2(s2),
      mLevel(level) {}

double CmWelchTPower::mPowerAt(double x) const {
  if (mSolveForSampleSize) {
    const int n = mSampleSizeFromDouble(x);
    return mCalcWelchTTestPower(mAlternative, n, n, mDifference, mS1, mS2, mLevel);
  }
  return mCalcWelchTTestPower(mAlternative, mN1, mN2, x, mS1, mS2, mLevel);
}

}  // namespace qel
