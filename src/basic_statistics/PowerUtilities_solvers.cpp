// Solvers of the power formulas: the effect that reaches a power with a given
// sample size, and the smallest whole sample size that reaches a power with a
// given effect. Every search runs the bracket finder and the Illinois root
// finder on a power function object; sample-size searches move on whole
// numbers, so that the answer is the first n whose power reaches the target.
#include <algorithm>
#include <cmath>

#include "basic_statistics/PowerUtilities.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"

namespace qel {

namespace {

const double kMissing = mGetMissingValueCode();

// Coefficients of the quadratics that bound the noncentrality of the
// noncentral t kernel (its limit on the Poisson mixture behind the
// distribution: ncp^2 / 2 + 6.1738 ncp / sqrt(2) + df / 2 <= 94906265).
constexpr double kElvWidth = 6.1738;
constexpr double kElvShape = 94906265.0;
constexpr double kHalfWidth = 4.365535845689506;  // 6.1738 / sqrt(2)
constexpr double kSqrtTwo = 1.4142135623730951;
constexpr double kZSampleSizeEnd = 999999.0;

bool isProbability(double p) {
  return p > 0.0 && p < 1.0;
}

// The largest effect the t kernel can take with n per sample: the positive
// root of 0.5 x^2 + 6.1738 / sqrt(2) x + (df / 2 - 94906265), in units of
// sigma / sqrt(n) (one sample) or sigma / sqrt(n / 2).
double tEffectUpperEnd(int n, double sigma, bool oneSample) {
  const double df = oneSample ? n - 1.0 : 2.0 * n - 2.0;
  const double x = mRootOfQuadratic(0.5, kHalfWidth, df / 2.0 - kElvShape);
  if (mIsNumericMissing(x) || !(x > 0.0)) return kMissing;
  return mReduceUpperEnd(x * sigma / std::sqrt(oneSample ? n : n / 2.0));
}

// The largest sample size the t kernel can take for the standardised effect
// r: x = sqrt(n) from the kernel's quadratic, then floor(x^2) - 1; 999999
// when that leaves no room above 2.
double tSampleSizeUpperEnd(double r, bool twoSampleQuadratic, bool fallback) {
  double x;
  if (twoSampleQuadratic) {
    x = mRootOfQuadratic(r * r / 4.0 + 1.0, r * kElvWidth / 2.0, -(kElvShape + 1.0));
  } else {
    x = mRootOfQuadratic(r * r / 2.0 + 0.5, r * kElvWidth / kSqrtTwo, -(kElvShape + 0.5));
  }
  double u = mIsNumericMissing(x) ? 0.0 : std::floor(std::pow(mReduceUpperEnd(x), 2.0)) - 1.0;
  if (fallback && u <= 2.0) u = kZSampleSizeEnd;
  return u;
}

// The root of f between x1 and x2 (f of opposite signs there) by the
// Illinois method of Dowell and Jarratt (BIT 11 (1971) 168-174): a secant
// step, and the stored value of the retained end halved only when the same
// end is retained twice running, which keeps the order of convergence near
// 1.44. (Halving it at every step, as mRootFinder does, converges only
// linearly: 20 and more power evaluations where 5 or 6 suffice.) Ends with
// the convergence tests of f.
double illinoisRoot(CmRealFunction& f, double x1, double x2) {
  double f1 = f(x1), f2 = f(x2);
  if (mIsNumericMissing(f1) || mIsNumericMissing(f2)) return kMissing;
  if (f.mIsConvergedForF(f1)) return x1;
  if (f.mIsConvergedForF(f2)) return x2;
  if ((f1 > 0.0) == (f2 > 0.0)) return kMissing;
  for (int step = 0; step < 200; ++step) {
    const double x = x2 - f2 * (x2 - x1) / (f2 - f1);
    const double fx = f(x);
    if (mIsNumericMissing(fx) || !std::isfinite(x)) return kMissing;
    if (f.mIsConvergedForF(fx)) return x;
    if ((fx > 0.0) != (f2 > 0.0)) {
      x1 = x2;
      f1 = f2;
    } else {
      f1 /= 2.0;
    }
    x2 = x;
    f2 = fx;
    if (f.mIsConvergedForX(x1, x2)) return x2;
  }
  return x2;
}

// Root of f on [lower, upper] after the bracket search; the missing value
// when there is no bracket or no root. Sample-size searches (on whole
// numbers) go to mRootFinder, whose integer rule returns the first whole
// number at which f reaches zero.
double bracketAndRoot(double x1, double x2, double lower, double upper, CmRealFunction& f) {
  if (mBracketFinder(&x1, &x2, f, lower, upper) != 0) return kMissing;
  if (!f.mIntegerValued) return illinoisRoot(f, x1, x2);
  int status = 0;
  return mRootFinder(x1, x2, f, &status);
}

// Sample-size search shared by the t and Welch solvers: n = 2 if it already
// reaches the target, else the smallest whole n within [2, top] whose power
// reaches it; the top itself when no n within it does. The power rises with
// n, so the answer is found by bracketing on whole numbers, upward in
// doubling steps from next to the guess (the normal-theory n) or from 2,
// and bisecting; only the number of power evaluations (about five with a
// good guess) depends on the start.
int sampleSizeSearch(CmRealFunction& f, double top, double guess) {
  top = std::floor(top);
  const double at2 = f(2.0);
  if (mIsNumericMissing(at2)) return -1;
  if (at2 >= 0.0) return 2;
  double below = 2.0;  // f < 0 here
  if (guess > 3.0 && guess < top) {
    const double start = std::floor(guess) - 1.0;
    const double value = f(start);
    if (mIsNumericMissing(value)) return -1;
    if (value < 0.0) {
      below = start;
    } else {
      top = start;  // the answer lies in (2, start]
    }
  }
  double above = below;
  double step = 3.0;
  for (;;) {
    above = std::min(top, below + step);
    const double value = f(above);
    if (mIsNumericMissing(value)) return -1;
    if (value >= 0.0) break;
    if (above >= top) return mSampleSizeFromDouble(top);
    below = above;
    step *= 2.0;
  }
  while (above - below > 1.0) {
    const double middle = std::floor((below + above) / 2.0);
    const double value = f(middle);
    if (mIsNumericMissing(value)) return -1;
    (value >= 0.0 ? above : below) = middle;
  }
  return mSampleSizeFromDouble(above);
}

// Effect search shared by the t, z, Welch and proportion solvers, on the
// upper side: 0 if no effect is needed, else the root on [0, end]. The
// bracket search starts from +-1% about a guess within [0, end] rather than
// from the whole range: the far end is where the noncentral t kernel is
// slowest (a Poisson mixture with a mean near 1e8), and the root is the
// same.
double effectSearch(CmRealFunction& f, double end, double guess) {
  const double at0 = f(0.0);
  if (mIsNumericMissing(at0)) return kMissing;
  if (at0 >= 0.0) return 0.0;
  if (mIsNumericMissing(end) || !(end > 0.0)) return kMissing;
  if (guess > 0.0 && guess < end) return bracketAndRoot(0.99 * guess, 1.01 * guess, 0.0, end, f);
  return bracketAndRoot(0.0, end, 0.0, end, f);
}

// The one-sided quantile z_a of the test (a = level, or level / 2 for the
// two-sided alternative) and z_b of the power, from the normal or from the
// central t with df; their sum is the standardised effect of a test whose
// noncentral distribution were the central one shifted (exact for z, close
// for t: a starting point for the searches).
double quantileSum(double power, double level, EAlternative alternative, double df, bool useT) {
  const double a = alternative == kAlternativeNotEqual ? level / 2.0 : level;
  if (!(a > 0.0 && a < 1.0) || !isProbability(power)) return kMissing;
  const double za = useT ? mTInvCdf(1.0 - a, df, 0.0) : mNormalInvCdf(1.0 - a, 0.0, 1.0);
  const double zb = useT ? mTInvCdf(power, df, 0.0) : mNormalInvCdf(power, 0.0, 1.0);
  if (mIsNumericMissing(za) || mIsNumericMissing(zb)) return kMissing;
  return za + zb;
}

// The effect (standardised by se) that reaches the power: the quantile sum.
double effectGuess(double power, double level, EAlternative alternative, double df, bool useT,
                   double se) {
  const double z = quantileSum(power, level, alternative, df, useT);
  return mIsNumericMissing(z) || !(z > 0.0) ? kMissing : z * se;
}

// The normal-theory sample size per sample, (z_a + z_b)^2 / r^2 times 2 for
// two samples, plus Guenther's correction z_a^2 / 4 (two samples) or
// z_a^2 / 2 (one) for the t test (Guenther, J. Qual. Technol. 13 (1981)).
double sampleSizeGuess(double power, double level, EAlternative alternative, double r,
                       bool twoSamples, bool useT) {
  const double z = quantileSum(power, level, alternative, 0.0, false);
  if (mIsNumericMissing(z) || !(z > 0.0) || !(std::fabs(r) > 0.0)) return kMissing;
  if (alternative != kAlternativeNotEqual && (alternative > 0) != (r > 0.0)) return kMissing;
  const double a = alternative == kAlternativeNotEqual ? level / 2.0 : level;
  const double za = mNormalInvCdf(1.0 - a, 0.0, 1.0);
  const double n = (twoSamples ? 2.0 : 1.0) * z * z / (r * r);
  const double correction = useT ? za * za / (twoSamples ? 4.0 : 2.0) : 0.0;
  const double guess = n + correction;
  return std::isfinite(guess) && guess < 1e9 ? guess : kMissing;
}

double negateUnlessMissing(double x, bool negate) {
  return negate && !mIsNumericMissing(x) ? -x : x;
}

}  // namespace

bool mCalculateLowerUpperPos(double start, double step, double* lower, double* upper,
                             bool* rootAtLower, CmRealFunction& f, bool forSampleSize,
                             bool oneSample) {
  *rootAtLower = false;
  *lower = start;
  *upper = start + step;
  const double tolerance = forSampleSize ? 1.0 : 0.01;
  const double atLower = f(*lower);
  if (mIsNumericMissing(atLower)) return false;
  if (atLower > 0.0) {
    *rootAtLower = true;
    return true;
  }
  double limit = mGetMaxDataValue();
  if (forSampleSize) limit = oneSample ? mGetMaxInteger() : mGetMaxInteger() / 2.0;
  while (mIsNumericMissing(f(*upper))) {
    if (*upper - *lower <= tolerance) break;
    *upper = (*lower + *upper) / 2.0;
  }
  while (*upper < limit) {
    const double value = f(*upper);
    if (mIsNumericMissing(value)) return false;
    if (value > 0.0) return true;
    *upper *= 2.0;
  }
  *upper = std::min(*upper, limit);
  return false;
}

bool mCalculateLowerUpperNeg(double* lower, double* upper, CmRealFunction& f) {
  *lower = 1e-12;
  *upper = 1.0;
  const double atLower = f(*lower);
  const double atUpper = f(*upper);
  if (mIsNumericMissing(atLower) || mIsNumericMissing(atUpper)) return false;
  return atLower > 0.0 && atUpper < 0.0;
}

double mGetEffect(bool found, bool rootAtLower, double lower, double upper, CmRealFunction& f) {
  if (!found) return kMissing;
  if (rootAtLower) return lower;
  int status = 0;
  return mRootFinder(lower, upper, f, &status);
}

int mGetSampleSize(bool found, bool rootAtLower, double lower, double upper, CmRealFunction& f) {
  if (!found) return mSampleSizeFromDouble(upper);
  if (rootAtLower) return mSampleSizeFromDouble(std::ceil(lower));
  int status = 0;
  const double root = mRootFinder(lower, upper, f, &status);
  return mIsNumericMissing(root) ? -1 : mSampleSizeFromDouble(std::ceil(root));
}

double mTComputeXForPowerAndSampleSize(double power, int n, double sigma, EAlternative alternative,
                                       double level, bool oneSample, bool useT) {
  if (n < 1 || !(sigma > 0.0) || !isProbability(power)) return kMissing;
  const bool lower = alternative < 0;
  CmTPower f(lower ? kAlternativeGreater : alternative, n, 0.0, sigma, level, oneSample, useT,
             power, false);
  const double end = useT ? tEffectUpperEnd(n, sigma, oneSample) : 20.0 * sigma;
  const double se = sigma / std::sqrt(oneSample ? n : n / 2.0);
  const double df = oneSample ? n - 1.0 : 2.0 * n - 2.0;
  const double guess = effectGuess(power, level, alternative, df, useT && df > 0.0, se);
  return negateUnlessMissing(effectSearch(f, end, guess), lower);
}

int mTCalcSampleSizeGivenPower(EAlternative alternative, double power, double effect, double sigma,
                               double level, bool oneSample, bool useT, bool paired) {
  if (!(sigma > 0.0) || !isProbability(power) || mIsNumericMissing(effect)) return -1;
  CmTPower f(alternative, 0, effect, sigma, level, oneSample || paired, useT, power, true);
  const double top =
      useT ? tSampleSizeUpperEnd(effect / sigma, !oneSample || paired, true) : kZSampleSizeEnd;
  const double guess =
      sampleSizeGuess(power, level, alternative, effect / sigma, !(oneSample || paired), useT);
  return sampleSizeSearch(f, top, guess);
}

double mCalcEffectForWelchTTestPower(EAlternative alternative, double power, int n1, int n2,
                                     double s1, double s2, double level) {
  if (n1 < 2 || n2 < 2 || !(s1 > 0.0) || !(s2 > 0.0) || !isProbability(power)) return kMissing;
  const bool lower = alternative < 0;
  CmWelchTPower f(lower ? kAlternativeGreater : alternative, n1, n2, 0.0, s1, s2, level, power,
                  false);
  const double pooled = std::sqrt(((n1 - 1.0) * s1 * s1 + (n2 - 1.0) * s2 * s2) / (n1 + n2 - 2.0));
  const double end = tEffectUpperEnd(std::max(n1, n2), pooled, false);
  const double se = std::sqrt(s1 * s1 / n1 + s2 * s2 / n2);
  const double guess =
      effectGuess(power, level, alternative, mCalcWelchDF(n1, n2, s1, s2), true, se);
  return negateUnlessMissing(effectSearch(f, end, guess), lower);
}

int mCalcSampleSizeForWelchTTestPower(EAlternative alternative, double power, double difference,
                                      double s1, double s2, double level) {
  if (!(s1 > 0.0) || !(s2 > 0.0) || !isProbability(power) || mIsNumericMissing(difference)) {
    return -1;
  }
  CmWelchTPower f(alternative, 0, 0, difference, s1, s2, level, power, true);
  const double pooled = std::sqrt(s1 * s1 / 2.0 + s2 * s2 / 2.0);
  const double top = tSampleSizeUpperEnd(difference / pooled, true, false);
  const double guess = sampleSizeGuess(power, level, alternative, difference / pooled, true, true);
  return sampleSizeSearch(f, std::max(top, 2.0), guess);
}

double mComputePOneXForPowerAndSampleSize(EAlternative alternative, double power, int n,
                                          double critical, double null, bool oneSample) {
  if (!isProbability(power) || !(null >= 0.0 && null <= 1.0)) return kMissing;
  // The lower alternative is the upper one of the mirrored problem: the
  // proportions p and 1 - p play the same part.
  const bool mirrored = alternative < 0;
  const double base = mirrored ? 1.0 - null : null;
  CmPPower f(mirrored ? kAlternativeGreater : alternative, n, critical, 0.0, base, oneSample, power,
             false);
  const double top = oneSample ? 1.0 - mGetEps(false) : 1.0;
  const double d = effectSearch(f, top - base, kMissing);
  if (mIsNumericMissing(d)) return kMissing;
  return mirrored ? null - d : null + d;
}

double mComputePOneOtherXForPowerAndSampleSize(double power, int n, double critical, double null,
                                               bool oneSample) {
  if (!isProbability(power) || !(null >= 0.0 && null <= 1.0)) return kMissing;
  const double base = 1.0 - null;
  CmPPower f(kAlternativeNotEqual, n, critical, 0.0, base, oneSample, power, false);
  const double top = oneSample ? 1.0 - mGetEps(false) : 1.0;
  const double d = effectSearch(f, top - base, kMissing);
  return mIsNumericMissing(d) ? kMissing : null - d;
}

int mCalcPOneSampleSizeGivenPower(EAlternative alternative, double power, double effect,
                                  double critical, double null, bool oneSample) {
  if (!isProbability(power)) return -1;
  CmPPower f(alternative, 0, critical, effect, null, oneSample, power, true);
  const double top = std::floor(oneSample ? mGetMaxInteger() : mGetMaxInteger() / 2.0) - 1.0;
  const double at2 = f(2.0);
  if (mIsNumericMissing(at2)) return -1;
  if (at2 >= 0.0) return 2;
  const double atTop = f(top);
  if (mIsNumericMissing(atTop)) return -1;
  if (!(atTop > 0.0)) return mSampleSizeFromDouble(top);
  int status = 0;
  return mSampleSizeFromDouble(mRootFinder(2.0, top, f, &status));
}

int mCalcVarSampleSizeGivenPower(EAlternative alternative, double power, double ratio, double level,
                                 bool oneSample, bool ratioOfSigmas, ETestMethod method,
                                 double kurtosis) {
  if (!isProbability(power)) return -1;
  CmVariancePower f(alternative, 0, ratio, level, oneSample, ratioOfSigmas, method, kurtosis, power,
                    true);
  double lower = 0.0, upper = 0.0;
  bool rootAtLower = false;
  const bool found =
      mCalculateLowerUpperPos(2.0, 30.0, &lower, &upper, &rootAtLower, f, true, oneSample);
  return mGetSampleSize(found, rootAtLower, lower, upper, f);
}

double mCalcVarEffectGivenPower(EAlternative alternative, double power, int n, double level,
                                bool oneSample, bool ratioOfSigmas, ETestMethod method,
                                double kurtosis, bool positive) {
  if (!isProbability(power)) return kMissing;
  CmVariancePower f(alternative, n, 1.0, level, oneSample, ratioOfSigmas, method, kurtosis, power,
                    false);
  double lower = 0.0, upper = 0.0;
  bool rootAtLower = false;
  bool found;
  if (positive) {
    found = mCalculateLowerUpperPos(1.0, 2.0, &lower, &upper, &rootAtLower, f, false, oneSample);
  } else {
    found = mCalculateLowerUpperNeg(&lower, &upper, f);
  }
  return mGetEffect(found, rootAtLower, lower, upper, f);
}

}  // namespace qel
