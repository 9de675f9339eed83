// One and two variances against R (qchisq/pchisq, var.test, t.test on
// absolute deviations with Fieller's limits) and mpmath (Bonett's limits and
// trimmed kurtosis); duality of Bonett's tests and limits; edge cases,
// thread counts and bad input.
#include <gtest/gtest.h>
#include <omp.h>
#include <qel/variance_tests.h>

#include <cmath>
#include <limits>
#include <map>
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

const std::map<std::string, std::vector<double>>& samples() {
  static const auto table = [] {
    std::map<std::string, std::vector<double>> t;
    for (const auto& row : qeltest::loadReferenceData("variance_samples.csv", 1))
      t[row.text[0]] = row.numbers;
    return t;
  }();
  return table;
}

IntervalType typeOf(double t) {
  return static_cast<IntervalType>(static_cast<int>(t));
}
AlternativeHypothesis altOf(double a) {
  return static_cast<AlternativeHypothesis>(static_cast<int>(a));
}

OneVariance runOne(const std::vector<double>& x, double confidence, IntervalType type,
                   AlternativeHypothesis alternative, double variance0, int expectedCode = 0) {
  OneVariance r;
  r.n = static_cast<unsigned>(x.size());
  EXPECT_EQ(RunOneVariance(&r, x.data(), confidence, type, alternative, variance0), expectedCode);
  return r;
}

TwoVariance runTwo(const std::vector<double>& x, const std::vector<double>& y, double confidence,
                   IntervalType type, AlternativeHypothesis alternative, double ratio0,
                   bool levene) {
  TwoVariance r;
  r.firstN = static_cast<unsigned>(x.size());
  r.secondN = static_cast<unsigned>(y.size());
  RunTwoVariance(&r, x.data(), y.data(), confidence, type, alternative, ratio0, levene);
  return r;
}

#define NEAR_REL(actual, expected, tol, row) \
  EXPECT_LE(relativeError(actual, expected), tol) << (row).text[0] << " line " << (row).line

TEST(VariancesReference, AgreeWithRAndMpmath) {
  int checked = 0;
  for (const char* file : {"variances_r.csv", "variances.csv"}) {
    for (const auto& row : qeltest::loadReferenceData(file, 3)) {
      const auto& v = row.numbers;
      const auto& x = samples().at(row.text[1]);
      const std::string kind = row.text[0];
      if (kind == "onevar") {
        const OneVariance r = runOne(x, v[0], typeOf(v[1]), altOf(v[2]), v[3]);
        if (!std::isnan(v[4])) {
          NEAR_REL(r.chiSquareLowerLimit, v[4], 5e-10, row);
          NEAR_REL(r.chiSquareUpperLimit, v[5], 5e-10, row);
        } else {
          NEAR_REL(r.chiSquareStatistic, v[6], 1e-14, row);
          NEAR_REL(r.chiSquarePValue, v[7], 5e-10, row);
        }
      } else if (kind == "bonett1") {
        const OneVariance r = runOne(x, v[0], typeOf(v[1]), qel::kAlternativeNotEqual, 1.0);
        int status = -1;
        NEAR_REL(qel::v1::CalcTrimmedKurtosis(x.data(), r.variance, r.n, &status), v[2], 1e-13,
                 row);
        NEAR_REL(r.bonettLowerLimit, v[3], 5e-10, row);
        NEAR_REL(r.bonettUpperLimit, v[4], 5e-10, row);
      } else {
        const bool levene = kind == "levene";
        const auto& y = samples().at(row.text[2]);
        const TwoVariance r = runTwo(x, y, v[0], typeOf(v[1]), altOf(v[2]), v[3], levene);
        NEAR_REL(levene ? r.leveneStatistic : r.fStatistic, v[4], 1e-13, row);
        NEAR_REL(levene ? r.levenePValue : r.fPValue, v[5], 5e-10, row);
        NEAR_REL(levene ? r.leveneLowerLimit : r.fLowerLimit, v[6], 5e-10, row);
        NEAR_REL(levene ? r.leveneUpperLimit : r.fUpperLimit, v[7], 5e-10, row);
      }
      ++checked;
    }
  }
  EXPECT_GT(checked, 150);
}

// At confidence 1 - P a one-sided Bonett limit sits on the hypothesised
// value: a root taken on the wrong branch of either equation breaks this.
TEST(BonettDuality, LimitMeetsHypothesisAtOneMinusP) {
  int checked = 0;
  for (const char* name : {"a", "c", "e", "g"}) {
    const auto& x = samples().at(name);
    for (double scale : {0.6, 1.4}) {
      const double variance0 =
          scale * runOne(x, 0.95, qel::kIntervalTwoSided, qel::kAlternativeLess, 1.0).variance;
      for (int a : {-1, 1}) {
        const double p = runOne(x, 0.95, qel::kIntervalTwoSided, altOf(a), variance0).bonettPValue;
        if (!(p > 1e-6 && p < 0.999)) continue;
        const OneVariance r = runOne(x, 1.0 - p, typeOf(a), altOf(a), variance0);
        EXPECT_LE(relativeError(a == 1 ? r.bonettLowerLimit : r.bonettUpperLimit, variance0), 1e-8)
            << name << " " << scale << " " << a;
        ++checked;
      }
    }
  }
  for (auto pair : {std::make_pair("a", "b"), std::make_pair("c", "d"), std::make_pair("e", "f"),
                    std::make_pair("g", "h")}) {
    const auto& x = samples().at(pair.first);
    const auto& y = samples().at(pair.second);
    for (double ratio0 : {0.8, 1.0, 1.5}) {
      for (int a : {-1, 1}) {
        const double p =
            runTwo(x, y, 0.95, qel::kIntervalTwoSided, altOf(a), ratio0, false).bonettPValue;
        if (!(p > 1e-6 && p < 0.999)) continue;
        const TwoVariance r = runTwo(x, y, 1.0 - p, typeOf(a), altOf(a), ratio0, false);
        EXPECT_LE(relativeError(a == 1 ? r.bonettLowerLimit : r.bonettUpperLimit, ratio0), 1e-8)
            << pair.first << pair.second << " " << ratio0 << " " << a;
        ++checked;
      }
    }
  }
  EXPECT_GT(checked, 15);
}

TEST(VarianceEdges, KurtosisTrimAndDegenerateSamples) {
  // n = 5: no trimming, the mean 4; n = 6: trim 1/(2 sqrt 2) leaves 3.5.
  const std::vector<double> five = {1, 2, 3, 4, 10}, six = {1, 2, 3, 4, 5, 100};
  int status = -1;
  EXPECT_NEAR(qel::v1::CalcTrimmedKurtosis(five.data(), 12.5, 5, &status), 5.0 / 16 * 1394 / 156.25,
              1e-13);
  EXPECT_EQ(status, 0);
  double sum = 0, mean = 115.0 / 6, ss = 0;
  for (double v : six) sum += std::pow(v - 3.5, 4), ss += (v - mean) * (v - mean);
  EXPECT_NEAR(qel::v1::CalcTrimmedKurtosis(six.data(), ss / 5, 6, &status) /
                  (6.0 / 25 * sum / (ss * ss / 25)),
              1.0, 1e-13);
  // A constant sample: kurtosis 1, Bonett limits 0.
  const OneVariance flat =
      runOne({3, 3, 3, 3, 3, 3, 3}, 0.95, qel::kIntervalTwoSided, qel::kAlternativeNotEqual, 1.0);
  EXPECT_EQ(flat.bonettLowerLimit, 0.0);
  EXPECT_EQ(flat.bonettUpperLimit, 0.0);
  // A quantile not below n: no Bonett limits, code 0.
  const OneVariance tiny =
      runOne({1.0, 2.5}, 0.99, qel::kIntervalTwoSided, qel::kAlternativeNotEqual, 1.0);
  EXPECT_TRUE(std::isnan(tiny.bonettLowerLimit) && std::isnan(tiny.bonettUpperLimit));
  // F: an infinite statistic gives 0 against "greater", 0/0 gives 1.
  TwoVariance inf, nan;
  inf.firstN = inf.secondN = nan.firstN = nan.secondN = 10;
  inf.firstVariance = 2.0, inf.secondVariance = 0.0;
  nan.firstVariance = nan.secondVariance = 0.0;
  EXPECT_EQ(RunTwoVariance(&inf, 0.95, qel::kIntervalTwoSided, qel::kAlternativeGreater, 1.0), 0);
  EXPECT_EQ(RunTwoVariance(&nan, 0.95, qel::kIntervalTwoSided, qel::kAlternativeGreater, 1.0), 0);
  EXPECT_EQ(inf.fPValue, 0.0);
  EXPECT_EQ(nan.fPValue, 1.0);
}

TEST(VarianceEdges, LeveneSameOnOneAndFourThreads) {
  const int saved = omp_get_max_threads();
  std::vector<TwoVariance> r;
  for (int threads : {1, 4}) {
    omp_set_num_threads(threads);
    r.push_back(runTwo(samples().at("e"), samples().at("f"), 0.9, qel::kIntervalTwoSided,
                       qel::kAlternativeNotEqual, 1.2, true));
  }
  omp_set_num_threads(saved);
  EXPECT_EQ(r[0].leveneStatistic, r[1].leveneStatistic);
  EXPECT_EQ(r[0].levenePValue, r[1].levenePValue);
  EXPECT_EQ(r[0].leveneLowerLimit, r[1].leveneLowerLimit);
  EXPECT_FALSE(std::isnan(r[0].leveneUpperLimit));
}

TEST(VarianceBadInput, CodesAndNaN) {
  const auto& x = samples().at("a");
  const auto& y = samples().at("b");
  const auto badType = static_cast<IntervalType>(5);
  const auto badAlt = static_cast<AlternativeHypothesis>(7);
  OneVariance one = runOne(x, 0.95, badType, qel::kAlternativeLess, 1.0, 30002);
  EXPECT_TRUE(std::isnan(one.chiSquareLowerLimit) && std::isnan(one.chiSquarePValue));
  one = runOne(x, 0.95, qel::kIntervalTwoSided, badAlt, 1.0, 30002);
  EXPECT_TRUE(std::isnan(one.bonettPValue));
  for (bool levene : {false, true}) {
    TwoVariance two;
    two.firstN = static_cast<unsigned>(x.size());
    two.secondN = static_cast<unsigned>(y.size());
    EXPECT_EQ(
        RunTwoVariance(&two, x.data(), y.data(), 0.95, badType, qel::kAlternativeLess, 1.0, levene),
        30002);
    EXPECT_TRUE(std::isnan(two.fLowerLimit) && std::isnan(two.leveneLowerLimit));
  }
  // Hypothesised values of 0, tiny samples, NaN data, odd confidences:
  // code 0 and NaN where nothing can be formed, never a crash.
  one = runOne(x, 0.95, qel::kIntervalTwoSided, qel::kAlternativeNotEqual, 0.0);
  EXPECT_TRUE(std::isnan(one.bonettPValue) && std::isnan(one.chiSquarePValue));
  const TwoVariance zero =
      runTwo(x, y, 0.95, qel::kIntervalTwoSided, qel::kAlternativeLess, 0.0, false);
  EXPECT_TRUE(std::isnan(zero.bonettPValue));
  EXPECT_EQ(zero.fPValue, 1.0);
  std::vector<double> withNaN = x;
  withNaN[3] = kNaN;
  for (double confidence : {0.0, 1.0, kNaN, 0.95}) {
    for (bool levene : {false, true}) {
      runTwo(withNaN, y, confidence, qel::kIntervalTwoSided, qel::kAlternativeNotEqual, 1.0,
             levene);
      runTwo({1.0}, {2.0}, confidence, qel::kIntervalLowerBound, qel::kAlternativeGreater, 1.0,
             levene);
      runTwo({}, {}, confidence, qel::kIntervalUpperBound, qel::kAlternativeLess, 1.0, levene);
      runTwo({4, 4, 4}, {4, 4, 4, 4}, confidence, qel::kIntervalTwoSided, qel::kAlternativeLess,
             1.0, levene);
    }
    const OneVariance single =
        runOne({2.0}, confidence, qel::kIntervalTwoSided, qel::kAlternativeNotEqual, 1.0);
    EXPECT_TRUE(std::isnan(single.bonettPValue));
    EXPECT_TRUE(
        std::isnan(runOne(withNaN, confidence, qel::kIntervalTwoSided, qel::kAlternativeLess, 1.0)
                       .chiSquareLowerLimit));
  }
  EXPECT_TRUE(std::isnan(SolvePValueEquation(10, 20, 0.0, 1.0, 0.3)));
}

}  // namespace
