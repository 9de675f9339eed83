// Power formulas and solvers against R (power.t.test, power.prop.test,
// pchisq, pf) and against mpmath (noncentral t by quadrature, the normal
// approximations, Bonett's and Levene's formulas), and their answers to bad
// input.
#include <gtest/gtest.h>
#include <qel/basic_types.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <string>

#include "basic_statistics/PowerUtilities.h"
#include "reference_data.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"

namespace {

using qeltest::relativeError;
const double kMissing = qel::mGetMissingValueCode();

qel::EAlternative alt(double a) {
  return static_cast<qel::EAlternative>(static_cast<int>(a));
}

double crit(double a, double level) {
  return qel::mNormalCritValue(level, alt(a));
}

// R's noncentral t is accurate to about 1e-12 absolutely (its pnt aims at
// that): the tolerance is relative or that, whichever is larger.
void expectNearR(double actual, double expected, double relative, const qeltest::Row& r) {
  const double tolerance = std::max(relative * expected, 1e-12);
  EXPECT_NEAR(actual, expected, tolerance) << "line " << r.line << " " << r.text[0];
}

TEST(PowerFormulas, AgreeWithR) {
  for (const auto& r : qeltest::loadReferenceData("power_r.csv", 2)) {
    const std::string& kind = r.text[0];
    const std::string& type = r.text[1];
    const auto& v = r.numbers;
    const bool oneSample = type != "two.sample";
    if (kind == "tpower") {
      const double p = qel::mTOneCalcOnePower(alt(v[0]), static_cast<int>(v[1]), v[2], v[3], v[4],
                                              oneSample, true, kMissing);
      expectNearR(p, v[5], 1e-8, r);
    } else if (kind == "tn") {
      const int n = qel::mTCalcSampleSizeGivenPower(alt(v[0]), v[4], v[1], v[2], v[3], oneSample,
                                                    true, type == "paired");
      EXPECT_EQ(n, static_cast<int>(std::ceil(v[5]))) << "line " << r.line;
    } else if (kind == "teffect") {
      const double e = qel::mTComputeXForPowerAndSampleSize(v[4], static_cast<int>(v[1]), v[2],
                                                            alt(v[0]), v[3], oneSample, true);
      EXPECT_LT(relativeError(e, v[5]), 1e-9) << "line " << r.line << ": " << e;
    } else if (kind == "ppower") {
      const double p = qel::mPOneCalcOnePower(alt(v[0]), static_cast<int>(v[1]), crit(v[0], v[4]),
                                              v[3] - v[2], v[2], false);
      EXPECT_LT(relativeError(p, v[5]), 1e-8) << "line " << r.line;
    } else if (kind == "pn") {
      const int n = qel::mCalcPOneSampleSizeGivenPower(alt(v[0]), v[4], v[2] - v[1],
                                                       crit(v[0], v[3]), v[1], false);
      EXPECT_EQ(n, static_cast<int>(std::ceil(v[5]))) << "line " << r.line;
    } else if (kind == "peffect") {
      const double p2 = qel::mComputePOneXForPowerAndSampleSize(
          alt(v[0]), v[4], static_cast<int>(v[1]), crit(v[0], v[3]), v[2], false);
      // R extends its search past 1; no proportion reaches such a power.
      if (v[5] > 1.0) {
        EXPECT_EQ(p2, kMissing) << "line " << r.line;
      } else {
        EXPECT_LT(relativeError(p2, v[5]), 1e-9) << "line " << r.line;
      }
    } else if (kind == "varpower") {
      const int n = static_cast<int>(v[1]);
      const double p = qel::mChiSquareFVariancePower(alt(v[0]), n, n, v[2], v[3], oneSample, false);
      EXPECT_LT(relativeError(p, v[4]), 1e-8) << "line " << r.line << " " << p << " " << v[4];
    }
  }
}

// Powers from 1e-13 to 1 - 1e-13, relative to the mpmath value.
TEST(PowerFormulas, AgreeWithMpmath) {
  double worst = 0.0;
  std::string where;
  for (const auto& r : qeltest::loadReferenceData("power_mpmath.csv", 2)) {
    const std::string& kind = r.text[0];
    const bool one = r.text[1] == "one" || r.text[1] == "1";
    const auto& v = r.numbers;
    double p = kMissing;
    if (kind == "t" || kind == "z") {
      p = qel::mTOneCalcOnePower(alt(v[0]), static_cast<int>(v[1]), v[2], v[3], v[4], one,
                                 kind == "t", kMissing);
    } else if (kind == "prop1") {
      // No sample-type column: text[1] holds the alternative.
      const auto a = alt(std::stod(r.text[1]));
      p = qel::mPOneCalcOnePower(a, static_cast<int>(v[0]), qel::mNormalCritValue(v[3], a), v[2],
                                 v[1], true);
    } else if (kind == "poisson") {
      p = qel::mPoissonPower(alt(v[0]), static_cast<int>(v[1]), v[2], v[3], v[4], {v[5], v[6]},
                             one);
    } else if (kind == "bonett") {
      const int n = static_cast<int>(v[1]);
      p = qel::mBonettTestPower(alt(v[0]), n, n, v[2], v[3], one, false, v[4]);
    } else if (kind == "levene") {
      p = qel::mLeveneTestPower(alt(std::stod(r.text[1])), static_cast<int>(v[0]),
                                static_cast<int>(v[1]), v[2], v[3], false);
    } else if (kind == "welch") {
      p = qel::mCalcWelchTTestPower(alt(std::stod(r.text[1])), static_cast<int>(v[0]),
                                    static_cast<int>(v[1]), v[2], v[3], v[4], v[5]);
    }
    const double e = relativeError(p, v.back());
    if (e > worst) worst = e, where = kind + " line " + std::to_string(r.line);
  }
  EXPECT_LT(worst, 1e-8) << where;
}

TEST(PowerFormulas, NoEffectGivesTheLevel) {
  for (int a = -1; a <= 1; ++a) {
    for (bool t : {true, false}) {
      for (bool one : {true, false}) {
        const double p = qel::mTOneCalcOnePower(alt(a), 7, 0.0, 2.0, 0.05, one, t, kMissing);
        EXPECT_NEAR(p, 0.05, 1e-14) << a << t << one;
      }
    }
    EXPECT_NEAR(qel::mCalcWelchTTestPower(alt(a), 6, 11, 0.0, 1.0, 2.0, 0.01), 0.01, 1e-14);
    EXPECT_NEAR(qel::mChiSquareFVariancePower(alt(a), 9, 14, 1.0, 0.05, false, true), 0.05, 1e-12);
  }
}

// Bad input answers the missing value, never NaN, and traps nothing with the
// floating-point frame armed.
TEST(PowerFormulas, BadInputGivesMissingArmed) {
  const double big = 1e6;  // noncentrality far above sqrt(2 * max integer)
  const auto none = qel::kAlternativeNotEqual;
  const auto inf = std::numeric_limits<double>::infinity();
  qel::SetLynFpuStates();
  const double results[] = {
      qel::mPOneCalcOnePower(none, 10, 1.96, 0.5, 0.5, true),  // p1 = 1, one sample
      qel::mPOneCalcOnePower(none, 10, 1.96, 0.6, 0.5, false),
      qel::mChiSquareFVariancePower(none, 10, 10, 0.0, 0.05, true, false),
      qel::mBonettTestPower(none, 10, 10, 0.0, 0.05, false, false, 0.0),
      qel::mBonettTestPower(none, 10, 10, 2.0, 0.05, true, false, -3.0),
      qel::mLeveneTestPower(none, 10, 10, 0.0, 0.05, true),
      qel::mTOneCalcOnePower(none, 10, 1.0, 0.0, 0.05, true, true, kMissing),
      qel::mTOneCalcOnePower(none, 0, 1.0, 1.0, 0.05, true, false, kMissing),
      qel::mTOneCalcOnePower(none, 1, 1.0, 1.0, 0.05, true, true, kMissing),
      qel::mTOneCalcOnePower(none, 10, 1.0, 1.0, 0.0, true, true, kMissing),
      qel::mTOneCalcOnePower(none, 10, 1.0, 1.0, 1.0, true, false, kMissing),
      qel::mTOneCalcOnePower(none, 10, 1.0, 1.0, 0.05, true, true, big),
      qel::mTOneCalcOnePower(none, 10, 1e300, 1e-300, 0.05, false, true, kMissing),
      qel::mTOneCalcOnePower(none, 10, inf, 1.0, 0.05, false, false, kMissing),
      qel::mCalcWelchTTestPower(none, 10, 10, 1e5, 1.0, 1.0, 0.05),
      qel::mCalcWelchTTestPower(none, 1, 10, 1.0, 1.0, 1.0, 0.05),
      qel::mPoissonPower(none, 10, 1.0, -1.0, 0.05, {1.0}, true),
      qel::mPoissonPower(none, 10, 1.0, 0.5, 0.05, {1.0}, false),
      qel::mPoissonPower(none, 10, 1.0, 0.5, 0.05, {0.0}, true),
      qel::mVariancePower(none, 1, 1, 2.0, 0.05, true, false, qel::kVarianceLevene, 0.0),
      qel::mTComputeXForPowerAndSampleSize(0.9, 10, 0.0, none, 0.05, true, true),
      qel::mComputePOneXForPowerAndSampleSize(none, 0.9, 10, 1.96, kMissing, true),
  };
  qel::ResetFpuStates();
  for (std::size_t i = 0; i < sizeof results / sizeof results[0]; ++i) {
    EXPECT_EQ(results[i], kMissing) << "case " << i;
  }
  EXPECT_EQ(qel::mTCalcSampleSizeGivenPower(none, 0.9, 1.0, 0.0, 0.05, true, true, false), -1);
}

TEST(PowerSolvers, SmallestWholeSampleSize) {
  // Each solved n reaches the target and n - 1 does not (or n is 2).
  const auto up = qel::kAlternativeGreater;
  for (double power : {0.6, 0.9, 0.999}) {
    const int welch = qel::mCalcSampleSizeForWelchTTestPower(up, power, 0.7, 1.0, 2.0, 0.05);
    EXPECT_GE(qel::mCalcWelchTTestPower(up, welch, welch, 0.7, 1.0, 2.0, 0.05), power);
    EXPECT_LT(qel::mCalcWelchTTestPower(up, welch - 1, welch - 1, 0.7, 1.0, 2.0, 0.05), power);
    const double e = qel::mCalcEffectForWelchTTestPower(up, power, 8, 13, 1.0, 2.0, 0.05);
    EXPECT_NEAR(qel::mCalcWelchTTestPower(up, 8, 13, e, 1.0, 2.0, 0.05), power, 1e-10);
    for (int method = 0; method < 3; ++method) {
      const auto m = static_cast<qel::ETestMethod>(method);
      const int n = qel::mCalcVarSampleSizeGivenPower(up, power, 2.5, 0.05, false, false, m, 0.0);
      EXPECT_GE(qel::mVariancePower(up, n, n, 2.5, 0.05, false, false, m, 0.0), power);
      EXPECT_LT(qel::mVariancePower(up, n - 1, n - 1, 2.5, 0.05, false, false, m, 0.0), power);
      const double r = qel::mCalcVarEffectGivenPower(qel::kAlternativeLess, power, 25, 0.05, true,
                                                     true, m, 0.0, false);
      EXPECT_LT(r, 1.0);
      EXPECT_NEAR(qel::mVariancePower(qel::kAlternativeLess, 25, 25, r, 0.05, true, true, m, 0.0),
                  power, 1e-9);
    }
  }
  EXPECT_EQ(qel::mTCalcSampleSizeGivenPower(up, 0.8, 50.0, 1.0, 0.05, true, true, false), 2);
}

}  // namespace
