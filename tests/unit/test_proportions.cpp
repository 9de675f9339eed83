// One and two proportions against R (binom.test, prop.test, fisher.test) and
// against mpmath formulas (mid-P roots, Agresti-Coull/Caffo, corrected Wald
// and Wilson, corrected score test), plus the retyping rule, edge cases and
// bad input.
#include <gtest/gtest.h>
#include <qel/proportion_tests.h>

#include <cmath>
#include <functional>
#include <limits>
#include <string>
#include <vector>

#include "reference_data.h"

namespace {

using namespace qel::v0;
using qel::AlternativeHypothesis;
using qel::IntervalType;
using qeltest::relativeError;

const double kNaN = std::numeric_limits<double>::quiet_NaN();
const double kInf = std::numeric_limits<double>::infinity();

struct Line {
  std::string kind;
  std::vector<double> v;  // every field after the kind
  int line;
};

std::vector<Line> lines(const char* file) {
  std::vector<Line> out;
  for (const auto& row : qeltest::loadReferenceData(file, 1)) {
    Line l{row.text[0], row.numbers, row.line};
    out.push_back(l);
  }
  return out;
}

OneProportion one(double x, double n) {
  OneProportion r;
  r.events = static_cast<unsigned>(x);
  r.trials = static_cast<unsigned>(n);
  return r;
}

TwoProportion two(std::vector<double> const& v) {
  TwoProportion r;
  r.firstEvents = static_cast<unsigned>(v[0]);
  r.firstTrials = static_cast<unsigned>(v[1]);
  r.secondEvents = static_cast<unsigned>(v[2]);
  r.secondTrials = static_cast<unsigned>(v[3]);
  return r;
}

IntervalType typeOf(double t) {
  return static_cast<IntervalType>(static_cast<int>(t));
}
AlternativeHypothesis altOf(double a) {
  return static_cast<AlternativeHypothesis>(static_cast<int>(a));
}

#define NEAR_REL(actual, expected, tol, l) \
  EXPECT_LE(relativeError(actual, expected), tol) << (l).kind << " line " << (l).line

// Limits on the probability scale: relative 1e-10 with an absolute floor, as
// a limit near 0 magnifies the error of the normal quantile.
bool limitNear(double actual, double expected) {
  if (std::isinf(expected) || std::isnan(expected)) return relativeError(actual, expected) == 0.0;
  return std::fabs(actual - expected) <= 1e-10 * std::fabs(expected) + 1e-11;
}
#define NEAR_LIMIT(actual, expected, l) \
  EXPECT_TRUE(limitNear(actual, expected)) << (l).kind << " line " << (l).line << ": " << (actual)

// R's rows; binom.test limits at x = 0 and x = n hold only the finite one.
TEST(ProportionsReference, AgreeWithR) {
  int checked = 0;
  for (const Line& l : lines("proportions_r.csv")) {
    const auto& v = l.v;
    if (l.kind == "binom") {
      OneProportion r = one(v[0], v[1]);
      ASSERT_EQ(RunOneProportionClopperPearson(&r, v[2], typeOf(v[3])), 0);
      if (v[0] > 0) {
        NEAR_REL(r.lowerLimit, v[4], 1e-10, l);
      }
      if (v[0] < v[1]) {
        NEAR_REL(r.upperLimit, v[5], 1e-10, l);
      }
    } else if (l.kind == "binomp" && v[4] > 1e-280) {  // below, the binomial tail underflows
      OneProportion r = one(v[0], v[1]), lyn = one(v[0], v[1]);
      ASSERT_EQ(RunOneProportionClopperPearson(&r, altOf(v[3]), v[2]), 0);
      ASSERT_EQ(RunLynOneProportion(&lyn, false, altOf(v[3]), v[2]), 0);
      NEAR_REL(r.pValue, v[4], 1e-9, l);
      NEAR_REL(lyn.pValue, v[4], 1e-9, l);
    } else if (l.kind == "wilson" || l.kind == "wilsoncc") {
      OneProportion r = one(v[0], v[1]);
      ASSERT_EQ(RunOneProportionWilson(&r, l.kind == "wilsoncc", v[2], typeOf(v[3])), 0);
      // The library's normal quantile and tails carry up to 5e-11 relative error.
      NEAR_REL(r.lowerLimit, v[4], 1e-10, l);
      NEAR_REL(r.upperLimit, v[5], 1e-10, l);
    } else if (l.kind == "score") {
      OneProportion r = one(v[0], v[1]);
      ASSERT_EQ(RunOneProportionWilson(&r, false, qel::kAlternativeNotEqual, v[2]), 0);
      NEAR_REL(r.statistic * r.statistic, v[4], 1e-12, l);
      NEAR_REL(r.pValue, v[5], 5e-10, l);
    } else if (l.kind == "two") {
      TwoProportion r = two(v);
      ASSERT_EQ(RunLynTwoProportion(&r, true, v[4], qel::kIntervalTwoSided,
                                    qel::kAlternativeNotEqual, 0.0),
                0);
      NEAR_REL(r.statistic * r.statistic, v[5], 1e-12, l);
      NEAR_REL(r.pValue, v[6], 5e-10, l);
      NEAR_REL(r.lowerLimit, v[7], 5e-10, l);
      NEAR_REL(r.upperLimit, v[8], 5e-10, l);
    } else if (l.kind == "fisher") {
      TwoProportion r = two(v);
      ASSERT_EQ(RunLynTwoProportion(&r, false, altOf(v[4]), 0.0), 0);
      NEAR_REL(r.exactPValue, v[5], 1e-9, l);
      EXPECT_TRUE(std::isnan(r.firstProportion));  // the test-only form leaves them
    } else {
      continue;
    }
    ++checked;
  }
  EXPECT_GT(checked, 200);
}

// mpmath's rows: exact roots and sums, and the formula intervals.
TEST(ProportionsReference, AgreeWithMpmath) {
  int checked = 0;
  for (const Line& l : lines("proportions.csv")) {
    const auto& v = l.v;
    if (l.kind == "midp") {
      const auto x = static_cast<unsigned>(v[0]), n = static_cast<unsigned>(v[1]);
      EXPECT_LE(std::fabs(GetLowerMidPBound(x, n, v[2]) - v[4]), 1e-10 * v[4] + 1e-300) << l.line;
      NEAR_REL(GetUpperMidPBound(x, n, v[2]), v[5], 1e-10, l);
      OneProportion r = one(v[0], v[1]);
      ASSERT_EQ(RunOneProportionMidP(&r, 1.0 - 2.0 * v[2], qel::kIntervalTwoSided), 0);
      NEAR_REL(r.upperLimit, v[5], 1e-10, l);
    } else if ((l.kind == "midptest" || l.kind == "cptest" || l.kind == "lynexact") &&
               v[4] > 1e-280) {  // below, the binomial tails underflow
      OneProportion r = one(v[0], v[1]);
      const AlternativeHypothesis a = altOf(v[3]);
      const int code = l.kind == "midptest" ? RunOneProportionMidP(&r, a, v[2])
                       : l.kind == "cptest" ? RunOneProportionClopperPearson(&r, a, v[2])
                                            : RunLynOneProportion(&r, false, a, v[2]);
      ASSERT_EQ(code, 0);
      NEAR_REL(r.pValue, v[4], 1e-9, l);
    } else if (l.kind == "agresti" || l.kind == "waldcc" || l.kind == "wilson") {
      OneProportion r = one(v[0], v[1]);
      const bool flag = v[4] != 0.0;
      const int code = l.kind == "agresti"
                           ? RunOneProportionAgrestiCoullCI(&r, flag, v[2], typeOf(v[3]))
                       : l.kind == "waldcc" ? RunOneProportionWaldCI(&r, flag, v[2], typeOf(v[3]))
                                            : RunOneProportionWilson(&r, flag, v[2], typeOf(v[3]));
      ASSERT_EQ(code, 0);
      NEAR_LIMIT(r.lowerLimit, v[5], l);
      NEAR_LIMIT(r.upperLimit, v[6], l);
      EXPECT_TRUE(std::isnan(r.proportion));
    } else if (l.kind == "scorecc") {
      OneProportion r = one(v[0], v[1]);
      ASSERT_EQ(RunOneProportionWilson(&r, true, altOf(v[3]), v[2]), 0);
      NEAR_REL(r.statistic, v[5], 1e-12, l);
      NEAR_REL(r.pValue, v[6], 5e-10, l);
    } else if (l.kind == "caffo" || l.kind == "wald2cc") {
      TwoProportion r = two(v);
      const int code = l.kind == "caffo"
                           ? RunTwoProportionAgrestiCaffoCI(&r, v[6] != 0.0, v[4], typeOf(v[5]))
                           : RunTwoProportionWaldCI(&r, true, v[4], typeOf(v[5]));
      ASSERT_EQ(code, 0);
      NEAR_LIMIT(r.lowerLimit, v[7], l);
      NEAR_LIMIT(r.upperLimit, v[8], l);
      EXPECT_TRUE(std::isnan(r.difference));
    } else {
      continue;
    }
    ++checked;
  }
  EXPECT_GT(checked, 300);
}

// The application's exact interval turns one-sided at x = 0 and x = n; the
// plain forms keep the type. Data forms count the 0/1 entries.
TEST(OneProportionRules, RetypingAndDataForms) {
  OneProportion none = one(0, 20), all = one(20, 20);
  ASSERT_EQ(RunLynOneProportion(&none, false, 0.95, qel::kIntervalTwoSided), 0);
  EXPECT_EQ(none.lowerLimit, 0.0);
  EXPECT_NEAR(none.upperLimit, 1.0 - std::pow(0.05, 1.0 / 20), 1e-14);  // BetaInvCdf(.95, 1, n)
  ASSERT_EQ(RunLynOneProportion(&all, false, 0.95, qel::kIntervalTwoSided), 0);
  EXPECT_EQ(all.upperLimit, 1.0);
  EXPECT_NEAR(all.lowerLimit, std::pow(0.05, 1.0 / 20), 1e-14);  // BetaInvCdf(.05, n, 1)
  OneProportion plain = one(20, 20);
  ASSERT_EQ(RunOneProportion(&plain, false, 0.95, qel::kIntervalTwoSided), 0);
  EXPECT_NEAR(plain.lowerLimit, std::pow(0.025, 1.0 / 20), 1e-14);

  const std::vector<int> data = {1, 0, 0, 1, 1, 0, 1, 0, 0, 0};
  OneProportion fromData, summary = one(4, 10);
  fromData.trials = 10;
  ASSERT_EQ(RunLynOneProportion(&fromData, data.data(), true, 0.9, qel::kIntervalTwoSided,
                                qel::kAlternativeGreater, 0.3),
            0);
  ASSERT_EQ(RunLynOneProportion(&summary, true, 0.9, qel::kIntervalTwoSided,
                                qel::kAlternativeGreater, 0.3),
            0);
  EXPECT_EQ(fromData.events, 4u);
  EXPECT_EQ(fromData.proportion, 0.4);
  EXPECT_EQ(fromData.pValue, summary.pValue);
  EXPECT_NEAR(fromData.statistic, 0.1 / std::sqrt(0.21 / 10), 1e-14);
  EXPECT_NEAR(fromData.upperLimit - fromData.lowerLimit,
              2 * 1.6448536269514722 * std::sqrt(0.24 / 10), 1e-10);
}

TEST(OneProportionRules, EdgeCases) {
  OneProportion r = one(5, 5);
  ASSERT_EQ(RunOneProportionWilson(&r, true, 0.95, qel::kIntervalLowerBound), 0);
  EXPECT_EQ(r.upperLimit, kInf);
  // A huge sample: mid-P and exact bounds stay ordered around p.
  OneProportion big = one(123456, 1000000);
  ASSERT_EQ(RunOneProportionMidP(&big, 0.95, qel::kIntervalTwoSided), 0);
  EXPECT_LT(big.lowerLimit, 0.123456);
  EXPECT_GT(big.upperLimit, 0.123456);
  EXPECT_NEAR(big.upperLimit - big.lowerLimit, 2 * 1.959964 * std::sqrt(0.123456 * 0.876544 / 1e6),
              1e-5);
}

TEST(TwoProportionRules, NonZeroDeltaIsUnpooledWithoutFisher) {
  TwoProportion a = two({30, 100, 15, 100}), b = two({30, 100, 15, 100});
  ASSERT_EQ(
      RunLynTwoProportion(&a, true, 0.95, qel::kIntervalTwoSided, qel::kAlternativeGreater, 0.1),
      0);
  ASSERT_EQ(
      RunLynTwoProportion(&b, false, 0.95, qel::kIntervalTwoSided, qel::kAlternativeGreater, 0.1),
      0);
  EXPECT_EQ(a.statistic, b.statistic);
  EXPECT_NEAR(a.statistic, 0.05 / std::sqrt(0.21 / 100 + 0.1275 / 100), 1e-14);
  EXPECT_TRUE(std::isnan(a.exactPValue));
  EXPECT_EQ(a.difference, 0.3 - 0.15);
}

// Bad enumerators, empty and impossible samples: codes, NaN, preset P-values.
TEST(ProportionsBadInput, CodesAndNaN) {
  const auto badType = static_cast<IntervalType>(5);
  const auto badAlt = static_cast<AlternativeHypothesis>(7);
  OneProportion r = one(3, 10);
  EXPECT_EQ(RunOneProportionClopperPearson(&r, 0.95, badType), qel::qelFailBadEnumValue);
  EXPECT_TRUE(std::isnan(r.lowerLimit) && std::isnan(r.upperLimit));
  EXPECT_EQ(RunOneProportionMidP(&r, 0.95, badType), qel::qelFailBadEnumValue);
  EXPECT_EQ(RunOneProportionWilson(&r, true, 0.95, badType), qel::qelFailBadEnumValue);
  EXPECT_EQ(RunLynOneProportion(&r, false, 0.95, badType), qel::qelFailBadEnumValue);
  OneProportion zero = one(0, 10);
  EXPECT_EQ(RunLynOneProportion(&zero, false, 0.95, badType), qel::qelFailBadEnumValue);
  r.pValue = 0.125;
  EXPECT_EQ(RunOneProportionClopperPearson(&r, badAlt, 0.5), qel::qelFailBadEnumValue);
  EXPECT_EQ(RunOneProportionMidP(&r, badAlt, 0.5), qel::qelFailBadEnumValue);
  EXPECT_EQ(RunOneProportion(&r, false, 0.95, qel::kIntervalTwoSided, badAlt, 0.5),
            qel::qelFailBadEnumValue);
  EXPECT_EQ(r.pValue, 0.125);
  EXPECT_EQ(RunOneProportionWilson(&r, false, badAlt, 0.5), 0);
  EXPECT_TRUE(std::isnan(r.pValue));
  // Every interval refuses a confidence outside (0, 1) rather than cross.
  const std::function<int(OneProportion*, double, IntervalType)> intervals[] = {
      [](OneProportion* c, double v, IntervalType t) { return RunOneProportionMidP(c, v, t); },
      [](OneProportion* c, double v, IntervalType t) { return RunOneProportion(c, true, v, t); },
      [](OneProportion* c, double v, IntervalType t) { return RunOneProportion(c, false, v, t); },
      [](OneProportion* c, double v, IntervalType t) { return RunLynOneProportion(c, false, v, t); },
      [](OneProportion* c, double v, IntervalType t) {
        return RunOneProportionWilson(c, true, v, t);
      }};
  for (double confidence : {-0.5, 0.0, 1.0, 1.5, kNaN}) {
    for (const auto& interval : intervals) {
      for (IntervalType type : {qel::kIntervalTwoSided, qel::kIntervalLowerBound}) {
        for (unsigned events : {0u, 3u, 10u}) {
          OneProportion c = one(events, 10);
          EXPECT_EQ(interval(&c, confidence, type), qel::qelFailBadEnumValue) << confidence;
          EXPECT_TRUE(std::isnan(c.lowerLimit) && std::isnan(c.upperLimit));
        }
      }
    }
  }
  OneProportion empty = one(0, 0), over = one(12, 10);
  EXPECT_EQ(RunLynOneProportion(&empty, true, 0.95, qel::kIntervalTwoSided,
                                qel::kAlternativeNotEqual, 0.5),
            0);
  EXPECT_TRUE(std::isnan(empty.proportion) && std::isnan(empty.pValue));
  EXPECT_EQ(RunOneProportionWilson(&over, false, 0.95, qel::kIntervalTwoSided), 0);
  EXPECT_TRUE(std::isnan(over.lowerLimit));
  EXPECT_TRUE(std::isnan(GetLowerMidPBound(12, 10, 0.05)));
  EXPECT_TRUE(std::isnan(GetUpperMidPBound(0, 0, 0.05)));
  TwoProportion t = two({3, 10, 4, 0});
  EXPECT_EQ(RunLynTwoProportion(&t, true, 0.95, badType, qel::kAlternativeNotEqual, 0.0),
            qel::qelFailBadEnumValue);
  EXPECT_TRUE(std::isnan(t.statistic));
}

}  // namespace
