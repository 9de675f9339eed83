// The five-number summary, the extended summary and the boxplot helper
// against R (tools/reference/gen_summaries_r.R): type-6 quantiles, hinges at
// depth (n+3)/4, moments, modes and the interpolated sign interval of the
// median from qbinom/pbinom or qnorm/pnorm.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/summaries.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <limits>
#include <map>
#include <string>
#include <vector>

#include "interfaces/basic_statistics/summaries.h"
#include "reference_data.h"

namespace {

using qel::v1::FiveNumberSummary;
using qel::v1::LynBoxplotHelper;
using qeltest::relativeError;

constexpr double kTolerance = 1e-12;

std::map<std::string, std::vector<double>> loadSamples() {
  std::map<std::string, std::vector<double>> samples;
  for (const auto& row : qeltest::loadReferenceData("summary_samples.csv", 1)) {
    samples[row.text[0]] = row.numbers;
  }
  return samples;
}

// Columns of summaries_r.csv after the name.
enum Column {
  kConfidence,
  kN,
  kMinimum,
  kFirstQuartile,
  kMedian,
  kThirdQuartile,
  kMaximum,
  kLowerHinge,
  kUpperHinge,
  kMean,
  kSd,
  kLowerLimit,
  kUpperLimit,
  kModeCount,
  kFrequency,
  kFirstMode
};

void expectFive(const FiveNumberSummary& five, const std::vector<double>& r,
                const std::string& at) {
  EXPECT_LE(relativeError(five.minimum, r[kMinimum]), kTolerance) << at;
  EXPECT_LE(relativeError(five.firstQuartile, r[kFirstQuartile]), kTolerance) << at;
  EXPECT_LE(relativeError(five.median, r[kMedian]), kTolerance) << at;
  EXPECT_LE(relativeError(five.thirdQuartile, r[kThirdQuartile]), kTolerance) << at;
  EXPECT_LE(relativeError(five.maximum, r[kMaximum]), kTolerance) << at;
}

TEST(Summaries, AgreeWithR) {
  const auto samples = loadSamples();
  const auto rows = qeltest::loadReferenceData("summaries_r.csv", 1);
  ASSERT_GE(rows.size(), 40u);
  double worstLimit = 0.0;
  for (const auto& row : rows) {
    const auto& r = row.numbers;
    const std::string at = row.text[0] + " line " + std::to_string(row.line);
    ASSERT_EQ(samples.count(row.text[0]), 1u) << at;
    const std::vector<double>& x = samples.at(row.text[0]);
    const auto n = static_cast<unsigned>(x.size());
    ASSERT_EQ(n, r[kN]) << at;
    const std::vector<double> original = x;

    LynBoxplotHelper box;
    ASSERT_EQ(qel::v1::RunLynBoxplotHelper(&box, r[kConfidence], x.data(), n), qel::qelOk) << at;
    EXPECT_EQ(box.minimum, r[kMinimum]) << at;
    EXPECT_EQ(box.maximum, r[kMaximum]) << at;
    EXPECT_LE(relativeError(box.firstQuartile, r[kFirstQuartile]), kTolerance) << at;
    EXPECT_LE(relativeError(box.median, r[kMedian]), kTolerance) << at;
    EXPECT_LE(relativeError(box.thirdQuartile, r[kThirdQuartile]), kTolerance) << at;
    EXPECT_LE(relativeError(box.lowerHinge, r[kLowerHinge]), kTolerance) << at;
    EXPECT_LE(relativeError(box.upperHinge, r[kUpperHinge]), kTolerance) << at;
    EXPECT_LE(relativeError(box.mean, r[kMean]), kTolerance) << at;
    // R's sd is NA for one observation; the library's variance is 0 there.
    EXPECT_LE(relativeError(box.standardDeviation, n > 1 ? r[kSd] : 0.0), kTolerance) << at;
    const double lowerError = relativeError(box.medianLowerLimit, r[kLowerLimit]);
    const double upperError = relativeError(box.medianUpperLimit, r[kUpperLimit]);
    EXPECT_LE(lowerError, 1e-10) << at;
    EXPECT_LE(upperError, 1e-10) << at;
    worstLimit = std::max({worstLimit, lowerError, upperError});
    EXPECT_EQ(x, original) << at;

    FiveNumberSummary five;
    ASSERT_EQ(qel::v1::GetLynFiveNumberSummary(&five, x.data(), n), qel::qelOk) << at;
    expectFive(five, r, at);

    qel::v1::SecondSampleMoments moments;
    moments.n = n;
    FiveNumberSummary extended;
    double modes[5];
    unsigned modeCount = 99, frequency = 99;
    ASSERT_EQ(qel::v1::GetLyn2013ExtendedSummary(&moments, &extended, modes, &modeCount, &frequency,
                                                 x.data()),
              qel::qelOk)
        << at;
    expectFive(extended, r, at);
    EXPECT_LE(relativeError(moments.mean, r[kMean]), kTolerance) << at;
    if (n > 1) {
      EXPECT_LE(relativeError(moments.variance, r[kSd] * r[kSd]), 1e-11) << at;
    }
    EXPECT_EQ(modeCount, r[kModeCount]) << at;
    EXPECT_EQ(frequency, r[kFrequency]) << at;
    for (int i = 0; i < 5; ++i) {
      EXPECT_EQ(relativeError(modes[i], r[kFirstMode + i]), 0.0) << at << " mode " << i;
    }
  }
  std::printf("largest relative error of the median limits against R: %.3g\n", worstLimit);
}

TEST(Summaries, EmptySample) {
  FiveNumberSummary five;
  five.minimum = five.firstQuartile = five.median = five.thirdQuartile = five.maximum = 1.0;
  EXPECT_EQ(qel::v1::GetLynFiveNumberSummary(&five, nullptr, 0), qel::qelOk);
  for (double v :
       {five.minimum, five.firstQuartile, five.median, five.thirdQuartile, five.maximum}) {
    EXPECT_TRUE(std::isnan(v));
  }

  LynBoxplotHelper box;
  box.mean = box.median = box.medianLowerLimit = 1.0;
  EXPECT_EQ(qel::v1::RunLynBoxplotHelper(&box, 0.95, nullptr, 0), qel::qelOk);
  for (double v : {box.minimum, box.maximum, box.firstQuartile, box.median, box.thirdQuartile,
                   box.medianLowerLimit, box.medianUpperLimit, box.lowerHinge, box.upperHinge,
                   box.mean, box.standardDeviation}) {
    EXPECT_TRUE(std::isnan(v));
  }

  qel::v1::SecondSampleMoments moments;
  FiveNumberSummary extended;
  double modes[5] = {1, 1, 1, 1, 1};
  unsigned modeCount = 7, frequency = 7;
  EXPECT_EQ(qel::v1::GetLyn2013ExtendedSummary(&moments, &extended, modes, &modeCount, &frequency,
                                               nullptr),
            qel::qelOk);
  EXPECT_TRUE(std::isnan(extended.median));
  EXPECT_EQ(modeCount, 0u);
  EXPECT_EQ(frequency, 0u);
  for (double m : modes) EXPECT_TRUE(std::isnan(m));
}

TEST(Summaries, IntervalLimitsAtTheEdges) {
  const double sorted[] = {1.0, 2.0, 4.0, 8.0};
  double lower = 0.0, upper = 0.0;
  // Confidence 1: no depth reaches it; NaN, not a crash.
  qel::v1::ExactTwoSidedCI(&lower, &upper, 1.0, sorted, 4);
  EXPECT_TRUE(std::isnan(lower));
  EXPECT_TRUE(std::isnan(upper));
  qel::v1::ApproximateTwoSidedCI(&lower, &upper, 1.0, sorted, 4);
  EXPECT_TRUE(std::isnan(lower));
  // An unchecked confidence outside [0, 1] gives NaN limits.
  qel::v1::ExactTwoSidedCI(&lower, &upper, 1.5, sorted, 4);
  EXPECT_TRUE(std::isnan(lower));
  qel::v1::ExactTwoSidedCI(&lower, &upper, std::numeric_limits<double>::quiet_NaN(), sorted, 4);
  EXPECT_TRUE(std::isnan(upper));
  // Confidence 0 shrinks the interval onto the median.
  qel::v1::ExactTwoSidedCI(&lower, &upper, 0.0, sorted, 4);
  EXPECT_DOUBLE_EQ(lower, 3.0);
  EXPECT_DOUBLE_EQ(upper, 3.0);
}

}  // namespace
