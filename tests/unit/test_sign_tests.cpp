// Sign test, Wilcoxon signed rank test and runs test against R
// (tools/reference/gen_sign_tests.R), and their edge cases.
#include <gtest/gtest.h>
#include <qel/sign_tests.h>

#include <cmath>
#include <map>
#include <string>
#include <vector>

#include "reference_data.h"

namespace {

const double kNaN = std::nan("");

std::map<std::string, std::vector<double>> loadSamples() {
  std::map<std::string, std::vector<double>> samples;
  for (const auto& row : qeltest::loadReferenceData("sign_tests_samples.csv", 1)) {
    samples[row.text[0]] = row.numbers;
  }
  return samples;
}

void expectClose(double actual, double expected, double tolerance, const std::string& what) {
  EXPECT_LE(qeltest::relativeError(actual, expected), tolerance)
      << what << ": " << actual << " vs " << expected;
}

TEST(SignTest, MatchesR) {
  const auto samples = loadSamples();
  const auto rows = qeltest::loadReferenceData("sign_tests_r.csv", 2);
  ASSERT_GT(rows.size(), 100u);
  for (const auto& row : rows) {
    if (row.text[0] != "sign" && row.text[0] != "lynsign") continue;
    const auto& x = samples.at(row.text[1]);
    const double* v = row.numbers.data();
    qel::v0::OneSampleSign r;
    r.n = static_cast<unsigned int>(x.size());
    const auto type = static_cast<qel::IntervalType>(static_cast<int>(v[0]));
    const auto alt = static_cast<qel::AlternativeHypothesis>(static_cast<int>(v[2]));
    const int code = row.text[0] == "sign"
                         ? qel::v0::RunOneSampleSign(&r, x.data(), v[1], type, alt, v[3])
                         : qel::v0::RunLynOneSampleSign(&r, x.data(), v[1], type, alt, v[3]);
    const std::string where = "line " + std::to_string(row.line);
    const double got[] = {r.median,
                          r.narrowerConfidence,
                          r.widerConfidence,
                          r.narrowerLowerLimit,
                          r.interpolatedLowerLimit,
                          r.widerLowerLimit,
                          r.narrowerUpperLimit,
                          r.interpolatedUpperLimit,
                          r.widerUpperLimit,
                          r.narrowerPosition,
                          r.widerPosition};
    // Achieved confidences near 0 come from 1 - 2F with F near 1/2: compare
    // them on the absolute scale.
    for (int i = 1; i < 3; ++i) {
      if (std::isnan(v[4 + i])) {
        EXPECT_TRUE(std::isnan(got[i])) << where;
      } else {
        EXPECT_NEAR(got[i], v[4 + i], 1e-10) << where;
      }
    }
    for (int i : {0, 3, 4, 5, 6, 7, 8, 9, 10})
      expectClose(got[i], v[4 + i], 1e-10, where + " field " + std::to_string(i));
    EXPECT_EQ(code, static_cast<int>(v[15])) << where;
    expectClose(r.pValue, v[16], 1e-10, where + " P-value");
    EXPECT_EQ(r.countBelow, v[17]) << where;
    EXPECT_EQ(r.countEqual, v[18]) << where;
    EXPECT_EQ(r.countAbove, v[19]) << where;

    // A bad interval type: 30002, every limit NaN, no test.
    qel::v0::OneSampleSign bad;
    bad.n = r.n;
    EXPECT_EQ(qel::v0::RunLynOneSampleSign(&bad, x.data(), v[1], static_cast<qel::IntervalType>(2),
                                           alt, v[3]),
              qel::qelFailBadEnumValue);
    for (double limit :
         {bad.narrowerLowerLimit, bad.interpolatedUpperLimit, bad.widerUpperLimit, bad.pValue})
      EXPECT_TRUE(std::isnan(limit)) << where;
  }
}

TEST(SignTest, EdgeCases) {
  const double x[] = {2.0, 2.0, 2.0, 2.0, 2.0, 2.0};
  qel::v0::OneSampleSign r;
  r.n = 6;
  qel::v0::RunOneSampleSign(&r, x, 0.95, qel::kIntervalTwoSided, qel::kAlternativeNotEqual, 2.0);
  EXPECT_EQ(r.pValue, 1.0);
  EXPECT_EQ(r.countEqual, 6.0);
  EXPECT_EQ(r.countAbove, 0.0);

  // n = 0: nothing to estimate, the test has no evidence.
  r.n = 0;
  EXPECT_EQ(qel::v0::RunOneSampleSign(&r, x, 0.95, qel::kIntervalTwoSided,
                                      qel::kAlternativeNotEqual, 0.0),
            0);
  EXPECT_TRUE(std::isnan(r.median));
  EXPECT_TRUE(std::isnan(r.interpolatedLowerLimit));
  EXPECT_EQ(r.pValue, 1.0);
  EXPECT_EQ(r.n, 0u);
}

TEST(WilcoxonTest, MatchesR) {
  const auto samples = loadSamples();
  int checked = 0;
  for (const auto& row : qeltest::loadReferenceData("sign_tests_r.csv", 2)) {
    if (row.text[0] != "wilcoxon") continue;
    ++checked;
    const auto& x = samples.at(row.text[1]);
    const double* v = row.numbers.data();
    const auto type = static_cast<qel::IntervalType>(static_cast<int>(v[0]));
    const auto alt = static_cast<qel::AlternativeHypothesis>(static_cast<int>(v[2]));
    const std::string where = "line " + std::to_string(row.line);
    qel::v0::OneSampleWilcoxon r;
    r.n = static_cast<int>(x.size());
    EXPECT_EQ(qel::v0::RunLynOneSampleWilcoxon(&r, x.data(), v[1], type, alt, v[3]), 0);
    expectClose(r.estimatedMedian, v[4], 1e-13, where + " estimate");
    expectClose(r.achievedConfidence, v[5], 1e-10, where + " confidence");
    expectClose(r.lowerLimit, v[6], 1e-13, where + " lower");
    expectClose(r.upperLimit, v[7], 1e-13, where + " upper");
    expectClose(r.W, v[8], 1e-13, where + " W");
    expectClose(r.pValue, v[9], 1e-10, where + " P-value");
    EXPECT_EQ(r.n, static_cast<int>(v[10])) << where;

    // The interval form gives the same interval and leaves the test fields;
    // under a bad interval type it answers 30002 and NaN limits.
    for (int bad : {0, 1}) {
      qel::v0::OneSampleWilcoxon ci;
      ci.n = static_cast<int>(x.size());
      EXPECT_EQ(qel::v0::RunLynOneSampleWilcoxon(&ci, x.data(), v[1],
                                                 bad ? static_cast<qel::IntervalType>(-2) : type),
                bad ? qel::qelFailBadEnumValue : 0);
      expectClose(ci.lowerLimit, bad ? kNaN : r.lowerLimit, 0.0, where);
      expectClose(ci.upperLimit, bad ? kNaN : r.upperLimit, 0.0, where);
      EXPECT_TRUE(std::isnan(ci.W));
    }
  }
  EXPECT_GT(checked, 40);
}

TEST(WilcoxonTest, EdgeCases) {
  const double same[] = {1.5, 1.5, 1.5, 1.5};
  qel::v0::OneSampleWilcoxon r;
  r.n = 4;
  EXPECT_EQ(qel::v0::RunLynOneSampleWilcoxon(&r, same, 0.95, qel::kIntervalTwoSided,
                                             qel::kAlternativeNotEqual, 1.5),
            0);
  EXPECT_EQ(r.n, 0);
  EXPECT_TRUE(std::isnan(r.W));
  EXPECT_TRUE(std::isnan(r.pValue));
  EXPECT_EQ(r.estimatedMedian, 1.5);

  qel::v0::OneSampleWilcoxon empty;
  EXPECT_EQ(qel::v0::RunLynOneSampleWilcoxon(&empty, same, 0.95, qel::kIntervalTwoSided,
                                             qel::kAlternativeNotEqual, 0.0),
            0);
  EXPECT_TRUE(std::isnan(empty.estimatedMedian));
  EXPECT_TRUE(std::isnan(empty.W));
}

TEST(RunsTest, MatchesR) {
  const auto samples = loadSamples();
  int checked = 0;
  for (const auto& row : qeltest::loadReferenceData("sign_tests_r.csv", 2)) {
    if (row.text[0] != "runs") continue;
    ++checked;
    const auto& x = samples.at(row.text[1]);
    const double* v = row.numbers.data();
    const std::string where = "line " + std::to_string(row.line);
    const auto n = static_cast<unsigned>(x.size());
    qel::v1::RunsTest exact, approximate, counts;
    EXPECT_EQ(qel::v1::RunRunsTest(&exact, x.data(), v[0], n), 0);
    EXPECT_EQ(qel::v1::RunLynRunsTest(&approximate, x.data(), v[0], n), 0);
    EXPECT_EQ(qel::v1::CreateRunsTestStatistics(&counts, x.data(), v[0], n), 0);
    for (auto const* r : {&exact, &approximate, &counts}) {
      EXPECT_EQ(r->countBelow, v[1]) << where;
      EXPECT_EQ(r->countAbove, v[2]) << where;
      EXPECT_EQ(r->observedRuns, v[3]) << where;
      expectClose(r->expectedRuns, v[4], 1e-15, where + " expected");
    }
    expectClose(exact.pValue, v[5], 1e-12, where + " exact P");
    expectClose(approximate.pValue, v[6], 1e-10, where + " approximate P");
    EXPECT_TRUE(std::isnan(counts.pValue));
  }
  EXPECT_GT(checked, 10);
}

TEST(RunsTest, AllEqualToK) {
  const double x[] = {4.0, 4.0, 4.0};
  qel::v1::RunsTest r;
  EXPECT_EQ(qel::v1::RunRunsTest(&r, x, 4.0, 3), 0);
  EXPECT_EQ(r.countBelow + r.countAbove + r.observedRuns, 0u);
  EXPECT_TRUE(std::isnan(r.expectedRuns));
  EXPECT_TRUE(std::isnan(r.pValue));
  EXPECT_EQ(qel::v1::RunLynRunsTest(&r, x, 4.0, 0), 0);
  EXPECT_TRUE(std::isnan(r.pValue));
}

}  // namespace
