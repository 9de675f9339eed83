// The multi-sample variances test against R (bartlett.test, Box's F,
// var.test, qchisq limits, Levene as anova(lm)) and against an mpmath
// evaluation of the multiple comparison formulas.
#include <gtest/gtest.h>
#include <omp.h>
#include <qel/variances_test.h>

#include <cmath>
#include <limits>
#include <map>
#include <string>
#include <vector>

#include "interfaces/basic_statistics/variances_test.h"
#include "reference_data.h"

namespace {

using qel::v0::RunVariancesTest;
using qel::v0::VariancesTest;
using qel::v0::VariancesTestSample;
using qeltest::relativeError;
const double kNaN = std::numeric_limits<double>::quiet_NaN();

// The samples of tools/reference/gen_variances_multi_r.R.
std::vector<std::vector<double>> formulaSamples(unsigned k) {
  std::vector<std::vector<double>> xs(k);
  for (unsigned i = 0; i < k; ++i) {
    const unsigned n = 4 + (7 * i) % 13;
    for (unsigned j = 1; j <= n; ++j) {
      const double u = std::fmod(j * 0.6180339887498949 + (i + 1) * 0.41421356237309503, 1.0);
      xs[i].push_back((1.0 + 0.35 * (i % 5)) * 10.0 * u * u + i);
    }
  }
  return xs;
}

struct Outcome {
  VariancesTest test;
  std::vector<VariancesTestSample> samples;
  int code = -1;
};

Outcome run(const std::vector<std::vector<double>>& xs, double confidence, bool normal) {
  Outcome r;
  r.samples.resize(xs.size());
  for (std::size_t i = 0; i < xs.size(); ++i) {
    r.samples[i].data = xs[i].data();
    r.samples[i].n = static_cast<unsigned>(xs[i].size());
  }
  r.test.samples = r.samples.data();
  r.test.k = static_cast<unsigned>(xs.size());
  r.code = RunVariancesTest(&r.test, confidence, normal);
  return r;
}

TEST(VariancesMultiTest, MatchesR) {
  for (const auto& row : qeltest::loadReferenceData("variances_multi_r.csv", 1)) {
    const auto& v = row.numbers;
    const unsigned k = static_cast<unsigned>(v[0]);
    const auto xs = formulaSamples(k);
    SCOPED_TRACE("line " + std::to_string(row.line));
    if (row.text[0] == "main") {
      const Outcome normal = run(xs, 0.95, true);
      ASSERT_EQ(normal.code, 0);
      EXPECT_LT(relativeError(normal.test.mainStatistic, v[1]), 1e-11);
      EXPECT_LT(relativeError(normal.test.mainPValue, v[2]), 1e-9);
      EXPECT_TRUE(std::isnan(normal.test.leveneStatistic) && std::isnan(normal.test.levenePValue));
      // Levene's step alone for many samples: the k(k-1)/2 comparisons of
      // the general form are checked below on smaller k.
      Outcome general = normal;
      if (k < 130) {
        general = run(xs, 0.95, false);
        ASSERT_EQ(general.code, 0);
      } else {
        general.test.samples = general.samples.data();
        ASSERT_EQ(qel::v0::PerformMultipleLevene(&general.test), 0);
      }
      EXPECT_LT(relativeError(general.test.leveneStatistic, v[3]), 1e-11);
      EXPECT_LT(relativeError(general.test.levenePValue, v[4]), 1e-9);
    } else {
      const Outcome normal = run(xs, v[1], true);
      const auto& s = normal.samples[static_cast<std::size_t>(v[2])];
      EXPECT_DOUBLE_EQ(normal.test.individualConfidence, 1.0 - (1.0 - v[1]) / k);
      EXPECT_LT(relativeError(s.variance, v[3]), 1e-13);
      EXPECT_LT(relativeError(s.lowerLimit, v[4]), 1e-10);
      EXPECT_LT(relativeError(s.upperLimit, v[5]), 1e-10);
      EXPECT_TRUE(std::isnan(s.thirdWorkValue) && std::isnan(s.fourthWorkValue));
    }
  }
}

TEST(VariancesMultiTest, ComparisonsMatchMpmath) {
  std::map<std::string, std::vector<std::vector<double>>> data;
  std::map<std::string, std::map<double, Outcome>> runs;
  int checked = 0;
  for (const auto& row : qeltest::loadReferenceData("variances_mc.csv", 2)) {
    const std::string& name = row.text[1];
    const auto& v = row.numbers;
    SCOPED_TRACE(name + " line " + std::to_string(row.line));
    if (row.text[0] == "data") {
      data[name].push_back(v);
      continue;
    }
    auto found = runs[name].find(v[0]);
    if (found == runs[name].end())
      found = runs[name].emplace(v[0], run(data[name], v[0], false)).first;
    const Outcome& r = found->second;
    ASSERT_EQ(r.code, 0);
    if (row.text[0] == "test") {
      EXPECT_LT(relativeError(r.test.mainPValue, v[1]), 1e-8);
      EXPECT_TRUE(std::isnan(r.test.mainStatistic));
    } else {
      const auto& s = r.samples[static_cast<std::size_t>(v[1])];
      // The normal quantile behind Bonett's limits carries about 1e-11,
      // which the exponent of the limits amplifies about tenfold.
      EXPECT_LT(relativeError(s.lowerLimit, v[4]), 5e-10);
      EXPECT_LT(relativeError(s.upperLimit, v[5]), 5e-10);
      EXPECT_LT(relativeError(s.thirdWorkValue, v[6]), 1e-9);
      EXPECT_LT(relativeError(s.fourthWorkValue, v[7]), 1e-9);
    }
    ++checked;
  }
  EXPECT_GE(checked, 50);
}

TEST(VariancesMultiTest, BadInputs) {
  const std::vector<double> a{1, 2, 4, 7}, b{3, 1, 4, 1, 5, 9}, c{5, 5, 5, 5};
  // A confidence outside (0, 1) is refused before any work.
  for (double conf : {0.0, 1.0, -0.5, kNaN}) {
    const Outcome r = run({a, b}, conf, false);
    EXPECT_EQ(r.code, 30002);
    EXPECT_TRUE(std::isnan(r.samples[0].variance));
  }
  // No sample, one sample: no test.
  for (const auto& xs : {std::vector<std::vector<double>>{}, {b}}) {
    for (bool normal : {true, false}) {
      const Outcome r = run(xs, 0.95, normal);
      EXPECT_EQ(r.code, 0);
      EXPECT_TRUE(std::isnan(r.test.mainPValue) && std::isnan(r.test.levenePValue));
    }
  }
  // Empty, single-value and two-value samples; a NaN in the data.
  const std::vector<double> none, one{2.0}, two{1.0, 3.0}, withNaN{1.0, kNaN, 3.0, 4.0};
  for (const auto& xs :
       {std::vector<std::vector<double>>{a, none, b}, {a, one, b}, {a, two, b}, {a, withNaN, b}}) {
    for (bool normal : {true, false}) {
      const Outcome r = run(xs, 0.95, normal);
      EXPECT_EQ(r.code, 0);
      EXPECT_GE(r.test.mainPValue, 0.0);
      EXPECT_LE(r.test.mainPValue, 1.0);
    }
  }
  // Every sample constant: finite V (special cases), comparisons at the
  // quantile z; the range statistic cannot be formed.
  const Outcome flat = run({c, c, c}, 0.95, false);
  EXPECT_EQ(flat.code, 0);
  EXPECT_EQ(flat.test.mainPValue, 1.0);
  EXPECT_TRUE(std::isnan(flat.test.leveneStatistic));
  // n <= z: samples of 2 with k = 20 have no comparison limits, the rest do.
  std::vector<std::vector<double>> many(20, b);
  many[3] = two;
  many[3][1] = 2.5;
  const Outcome small = run(many, 0.95, false);
  EXPECT_TRUE(std::isnan(small.samples[3].thirdWorkValue) &&
              std::isnan(small.samples[3].fourthWorkValue));
  EXPECT_TRUE(std::isfinite(small.samples[0].thirdWorkValue));
  EXPECT_GE(small.test.levenePValue, 0.0);
}

TEST(VariancesMultiTest, ThreadCountDoesNotMatter) {
  const auto xs = formulaSamples(140);
  const int saved = omp_get_max_threads();
  std::vector<Outcome> runs;
  for (int threads : {1, 4}) {
    omp_set_num_threads(threads);
    runs.push_back(run(xs, 0.95, false));
    runs.push_back(run(xs, 0.95, true));
  }
  omp_set_num_threads(saved);
  for (int form = 0; form < 2; ++form) {
    const VariancesTest &t1 = runs[form].test, &t4 = runs[form + 2].test;
    EXPECT_NEAR(t4.mainPValue, t1.mainPValue, 1e-13);
    EXPECT_LT(relativeError(t4.mainStatistic, t1.mainStatistic), 1e-13);
    if (form == 0) { EXPECT_NEAR(t4.levenePValue, t1.levenePValue, 1e-13); }
    for (std::size_t i = 0; i < xs.size(); ++i)
      EXPECT_LT(relativeError(runs[form + 2].samples[i].fourthWorkValue,
                              runs[form].samples[i].fourthWorkValue), 1e-13);
  }
}

}  // namespace
