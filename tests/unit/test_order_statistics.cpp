// Sample quantiles against exact Hyndman-Fan values (tools/reference/
// gen_quantiles.py), their frame rules, the median of sorted data and the
// mode with its capacity rule.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/order_statistics.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <limits>
#include <map>
#include <string>
#include <vector>

#include "interfaces/basic_statistics/order_statistics.h"
#include "reference_data.h"

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

std::map<std::string, std::vector<double>> loadSamples() {
  std::map<std::string, std::vector<double>> samples;
  for (auto const& row : qeltest::loadReferenceData("quantile_samples.csv", 1)) {
    samples[row.text[0]] = row.numbers;
  }
  return samples;
}

double scaleOf(std::vector<double> const& x) {
  double scale = 0.0;
  for (double v : x) scale = std::max(scale, std::fabs(v));
  return scale;
}

// Rounding allowance of an interpolated quantile: the position n p + m
// carries a rounding of order eps (n + 1), which moves the result by that
// much times a gap between neighbouring order statistics, plus a few
// roundings of the data themselves.
double allowance(std::vector<double> const& x) {
  std::vector<double> s = x;
  std::sort(s.begin(), s.end());
  double gap = 0.0;
  for (std::size_t i = 1; i < s.size(); ++i) gap = std::max(gap, s[i] - s[i - 1]);
  const double eps = std::numeric_limits<double>::epsilon();
  return 2.0 * eps * scaleOf(x) + 2.0 * eps * double(x.size() + 1) * gap;
}

// Each reference value one at a time, then each (sample, type) with all its
// probabilities in one call.
void checkQuantilesAgainst(const char* file) {
  auto samples = loadSamples();
  auto rows = qeltest::loadReferenceData(file, 1);
  ASSERT_GT(rows.size(), 1900u);
  std::map<std::pair<std::string, int>, std::pair<std::vector<double>, std::vector<double>>> groups;
  double worst = 0.0;
  for (auto const& row : rows) {
    std::vector<double> const& x = samples.at(row.text[0]);
    std::vector<double> original = x;
    int type = static_cast<int>(row.numbers[0]);
    double p = row.numbers[1], expected = row.numbers[2];
    double q = kNaN;
    ASSERT_EQ(
        qel::v1::GetSampleQuantiles(x.data(), static_cast<unsigned>(x.size()), type, &q, &p, 1), 0);
    double error = std::fabs(q - expected);
    worst = std::max(worst, error / scaleOf(x));
    EXPECT_LE(error, allowance(x))
        << row.text[0] << " type " << type << " p " << p << ": " << q << " vs " << expected;
    EXPECT_EQ(x, original);  // the caller's data are not sorted in place
    auto& group = groups[{row.text[0], type}];
    group.first.push_back(p);
    group.second.push_back(expected);
  }
  for (auto const& [key, group] : groups) {
    std::vector<double> const& x = samples.at(key.first);
    std::vector<double> q(group.first.size(), kNaN);
    ASSERT_EQ(
        qel::v1::GetSampleQuantiles(x.data(), static_cast<unsigned>(x.size()), key.second, q.data(),
                                    group.first.data(), static_cast<unsigned>(q.size())),
        0);
    for (std::size_t c = 0; c < q.size(); ++c) {
      EXPECT_NEAR(q[c], group.second[c], allowance(x)) << key.first << " " << key.second;
    }
  }
  char text[32];
  std::snprintf(text, sizeof text, "%.3g", worst);
  ::testing::Test::RecordProperty(std::string("worst_error_relative_to_max_abs_") + file, text);
}

// Exact rational arithmetic on the paper's definitions.
TEST(SampleQuantiles, MatchTheNineHyndmanFanDefinitions) {
  checkQuantilesAgainst("quantiles.csv");
}

// The same points from R's quantile(), a peer system.
TEST(SampleQuantiles, MatchRsQuantileFunction) {
  checkQuantilesAgainst("quantiles_r.csv");
}

TEST(SampleQuantiles, FrameRulesHoldForEveryType) {
  const double x[] = {7.0, -2.0, 3.0, 3.0, 10.5};
  const double p[] = {0.0, 1.5, 1.0, -0.25, kNaN, 0.5};
  for (int type = 1; type <= 9; ++type) {
    double q[6];
    ASSERT_EQ(qel::v1::GetSampleQuantiles(x, 5, type, q, p, 6), 0) << type;
    EXPECT_EQ(q[0], -2.0) << type;
    EXPECT_TRUE(std::isnan(q[1])) << type;
    EXPECT_EQ(q[2], 10.5) << type;
    EXPECT_TRUE(std::isnan(q[3])) << type;
    EXPECT_TRUE(std::isnan(q[4])) << type;
    EXPECT_EQ(q[5], 3.0) << type;  // the median of five, whatever the type

    double empty[3] = {1.0, 2.0, 3.0};
    const double some[3] = {0.0, 0.5, 1.0};
    EXPECT_EQ(qel::v1::GetSampleQuantiles(nullptr, 0, type, empty, some, 3), 0);
    for (double v : empty) EXPECT_TRUE(std::isnan(v));
  }
  for (int type : {0, 10, -1}) {
    double q[2] = {42.0, 43.0};
    EXPECT_EQ(qel::v1::GetSampleQuantiles(x, 5, type, q, p, 2), qel::qelFailUnknownSelector);
    EXPECT_EQ(q[0], 42.0);
    EXPECT_EQ(q[1], 43.0);
  }
}

TEST(TypicalMedian, OddEvenAndEmpty) {
  const double sorted[] = {-1.0, 2.0, 2.5, 9.0};
  EXPECT_TRUE(std::isnan(qel::v1::GetTypicalMedian(sorted, 0)));
  EXPECT_EQ(qel::v1::GetTypicalMedian(sorted, 1), -1.0);
  EXPECT_EQ(qel::v1::GetTypicalMedian(sorted, 2), 0.5);
  EXPECT_EQ(qel::v1::GetTypicalMedian(sorted, 3), 2.0);
  EXPECT_EQ(qel::v1::GetTypicalMedian(sorted, 4), 2.25);
}

struct ModeResult {
  int code;
  std::vector<double> modes;
  unsigned count, frequency;
};

ModeResult mode(std::vector<double> const& x, unsigned capacity) {
  ModeResult r{-1, std::vector<double>(capacity, 123.0), 99, 99};
  r.code = qel::v1::GetMode(x.data(), static_cast<unsigned>(x.size()), r.modes.data(), capacity,
                            &r.count, &r.frequency);
  return r;
}

bool allNaN(std::vector<double> const& v, std::size_t from) {
  return std::all_of(v.begin() + from, v.end(), [](double d) { return std::isnan(d); });
}

TEST(Mode, CapacityAndFrequencyRules) {
  ModeResult distinct = mode({3.0, 1.0, 2.0}, 3);
  EXPECT_EQ(distinct.code, 0);
  EXPECT_EQ(distinct.count, 0u);
  EXPECT_EQ(distinct.frequency, 0u);
  EXPECT_TRUE(allNaN(distinct.modes, 0));

  ModeResult capped = mode({3.0, 1.0, 2.0, 3.0, 2.0, 1.0}, 2);
  EXPECT_EQ(capped.count, 2u);
  EXPECT_EQ(capped.frequency, 2u);
  EXPECT_EQ(capped.modes, (std::vector<double>{1.0, 2.0}));  // 3 is dropped

  // A longer run later replaces the modes found so far.
  ModeResult longer = mode({1.0, 1.0, 2.0, 2.0, 3.0, 3.0, 3.0, -4.0}, 3);
  EXPECT_EQ(longer.count, 1u);
  EXPECT_EQ(longer.frequency, 3u);
  EXPECT_EQ(longer.modes[0], 3.0);
  EXPECT_TRUE(allNaN(longer.modes, 1));

  // NaN never equals itself, so repeated NaN is not a mode.
  ModeResult withNaN = mode({kNaN, kNaN, kNaN, 0.5, 0.5}, 2);
  EXPECT_EQ(withNaN.count, 1u);
  EXPECT_EQ(withNaN.frequency, 2u);
  EXPECT_EQ(withNaN.modes[0], 0.5);

  for (ModeResult reset : {mode({}, 2), mode({1.0, 1.0}, 0)}) {
    EXPECT_EQ(reset.code, 0);
    EXPECT_EQ(reset.count, 0u);
    EXPECT_EQ(reset.frequency, 0u);
    EXPECT_TRUE(allNaN(reset.modes, 0));
  }

  const double sorted[] = {2.0, 2.0, 2.0, 5.0, 5.0, 5.0};
  double slots[4];
  unsigned frequency = 0;
  EXPECT_EQ(qel::v1::ModeOnSorted(sorted, 6, slots, 4, &frequency), 2u);
  EXPECT_EQ(frequency, 3u);
  EXPECT_EQ(slots[1], 5.0);
  EXPECT_TRUE(std::isnan(slots[2]) && std::isnan(slots[3]));
}

}  // namespace

namespace {

double plainMean(std::vector<double> const& v, std::size_t from, std::size_t to) {
  long double sum = 0.0L;
  for (std::size_t i = from; i < to; ++i) sum += v[i];
  return static_cast<double>(sum / static_cast<long double>(to - from));
}

// The number of observations dropped at each end follows the rounding rule
// of each form; the input is unsorted and must stay as it was.
TEST(TrimmedMeans, DropCountsOfTheFixedAndWholeObservationRules) {
  for (unsigned n : {1u, 2u, 9u, 10u, 19u, 29u, 30u, 41u}) {
    std::vector<double> sorted(n);
    for (unsigned i = 0; i < n; ++i) sorted[i] = 1.5 * i * i - 3.0;  // uneven gaps
    std::vector<double> x = sorted;
    std::reverse(x.begin(), x.end());
    std::swap(x.front(), x[n / 2]);
    std::vector<double> original = x;

    // Fixed rule: 5% rounded half up, k = 1 for n = 10, 0 for n = 9.
    std::size_t k = static_cast<std::size_t>((5 * n + 50) / 100);
    int status = -1;
    double lyn = qel::v1::GetLynTrimmedMean(x.data(), n, &status);
    EXPECT_EQ(status, 0);
    EXPECT_NEAR(lyn, plainMean(sorted, k, n - k),
                1e-15 * std::fabs(plainMean(sorted, 0, n)) + 1e-15)
        << n;
    EXPECT_EQ(x, original);

    for (double trim : {0.0, 0.1, 0.25}) {
      std::size_t drop = static_cast<std::size_t>(n * trim);  // rounded down
      double whole = qel::v1::GetTrimmedMean(x.data(), n, trim, &status);
      EXPECT_EQ(status, 0);
      if (2 * drop >= n) {
        EXPECT_TRUE(std::isnan(whole)) << n << " " << trim;
      } else {
        EXPECT_NEAR(whole, plainMean(sorted, drop, n - drop),
                    1e-15 * std::fabs(plainMean(sorted, 0, n)) + 1e-15)
            << n << " " << trim;
      }
    }
  }
  EXPECT_EQ(qel::v1::LynTrimmedMeanOnSorted(std::vector<double>{4.25}.data(), 1), 4.25);
  const double four[] = {1.0, 2.0, 3.0, 10.0};
  EXPECT_TRUE(std::isnan(qel::v1::TrimmedMeanOnSorted(four, 4, 0.5)));
  EXPECT_EQ(qel::v1::TrimmedMeanOnSorted(four, 4, 0.49), 2.5);
  EXPECT_TRUE(std::isnan(qel::v1::TrimmedMeanOnSorted(four, 4, -0.5)));
  int status = -1;
  EXPECT_TRUE(std::isnan(qel::v1::GetLynTrimmedMean(nullptr, 0, &status)));
  EXPECT_EQ(status, 0);
  status = -1;
  EXPECT_TRUE(std::isnan(qel::v1::GetTrimmedMean(nullptr, 0, 0.1, &status)));
  EXPECT_EQ(status, 0);
}

// Fractional end weights: with h = n*trim, g = floor(h), the observations
// g and n-g-1 weigh 1 - (h - g), those between them 1.
TEST(TrimmedMeans, FractionalEndWeights) {
  std::vector<double> sorted = {-7.0, -1.0, 0.5, 2.0, 2.0, 3.0, 4.5, 8.0, 9.0, 30.0};
  auto weighted = [&sorted](unsigned g, double w) {
    long double sum = w * sorted[g] + w * sorted[sorted.size() - 1 - g];
    for (std::size_t i = g + 1; i + 1 + g < sorted.size(); ++i) sum += sorted[i];
    return static_cast<double>(sum / (sorted.size() - 2 * g - 2 + 2 * w));
  };
  unsigned n = static_cast<unsigned>(sorted.size());
  EXPECT_NEAR(qel::v1::LynTrimmedMeanOnSorted(sorted.data(), n, 0.15), weighted(1, 0.5), 1e-15);
  EXPECT_NEAR(qel::v1::LynTrimmedMeanOnSorted(sorted.data(), n, 0.375), weighted(3, 0.25), 1e-15);
  EXPECT_NEAR(qel::v1::LynTrimmedMeanOnSorted(sorted.data(), n, 0.0), weighted(0, 1.0), 1e-15);
  // A whole number of observations: the whole-observation mean.
  EXPECT_NEAR(qel::v1::LynTrimmedMeanOnSorted(sorted.data(), n, 0.2),
              qel::v1::TrimmedMeanOnSorted(sorted.data(), n, 0.2), 1e-15);
  // Half trimmed: the middle one of an odd count, nothing of an even one.
  EXPECT_EQ(qel::v1::LynTrimmedMeanOnSorted(sorted.data(), 9, 0.5), 2.0);
  for (double trim : {0.5, 0.75, -0.2, kNaN})
    EXPECT_TRUE(std::isnan(qel::v1::LynTrimmedMeanOnSorted(sorted.data(), n, trim))) << trim;
  EXPECT_TRUE(std::isnan(qel::v1::LynTrimmedMeanOnSorted(sorted.data(), 0, 0.1)));

  // A large common offset: the compensated update keeps the small spread.
  std::vector<double> offset(1001);
  for (std::size_t i = 0; i < offset.size(); ++i) offset[i] = 1e12 + 0.001 * double(i);
  double expected = 1e12 + 0.001 * 500.0;  // symmetric weights around the middle
  EXPECT_NEAR(qel::v1::LynTrimmedMeanOnSorted(offset.data(), 1001, 0.1234), expected, 2e-4);
}

}  // namespace
