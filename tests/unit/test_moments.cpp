// The one-pass compensated moments against exact rational arithmetic on
// ill-conditioned data (a large offset over small noise, a million elements,
// values over 24 decades), with bounds near the measured errors so that a
// lost compensation shows; the edges are in test_descriptive_edges.cpp.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/descriptive.h>

#include <cmath>
#include <limits>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "interfaces/basic_statistics/utilities.h"
#include "moments_data.h"
#include "reference_data.h"

namespace {

using qeltest::relativeError;

const double kNaN = std::numeric_limits<double>::quiet_NaN();

double reference(const std::string& dataset, const std::string& quantity) {
  static const std::map<std::pair<std::string, std::string>, double> table = [] {
    std::map<std::pair<std::string, std::string>, double> t;
    for (const auto& row : qeltest::loadReferenceData("moments.csv", 2))
      t[{row.text[0], row.text[1]}] = row.numbers.at(0);
    return t;
  }();
  const auto it = table.find({dataset, quantity});
  if (it == table.end()) {
    ADD_FAILURE() << "no reference value " << dataset << "/" << quantity;
    return kNaN;
  }
  return it->second;
}

struct Case {
  std::string name;
  std::vector<double> x;
};

const std::vector<Case>& singleColumns() {
  static const std::vector<Case> cases = {
      {"offset", qeltest::offsetData(1000000, 7)},
      {"offset_small", qeltest::offsetData(2000, 11)},
      {"skewed", qeltest::skewedData(60000, 5)},
      {"magnitudes", qeltest::magnitudeData(100000, 3)},
  };
  return cases;
}

TEST(Moments, DataMatchTheGenerator) {
  for (const auto& c : singleColumns()) EXPECT_EQ(c.x.size(), reference(c.name, "n")) << c.name;
}

// Largest relative error allowed per data set and quantity: about twice what
// was measured, so that a change of the update formulas shows.
struct Bounds {
  double sum, mean, variance, m2, m3, m4, skewness, kurtosis;
};

const std::map<std::string, Bounds>& bounds() {
  // The central sum of fourth powers (and the kurtosis) is not checked beyond
  // 65537 elements: its weight k*k - k is formed in 32-bit unsigned arithmetic
  // and wraps from there on.
  static const std::map<std::string, Bounds> table = {
      {"offset", {2.3e-16, 2.3e-16, 6e-9, 6e-9, 2e-5, -1, 2e-5, -1}},
      {"offset_small", {2.3e-16, 2.3e-16, 3e-8, 3e-8, 6e-6, 5e-8, 6e-6, 2e-7}},
      {"skewed", {2.3e-16, 2.3e-16, 5e-13, 5e-13, 7e-13, 6e-13, 1.2e-14, 1.1e-12}},
      {"magnitudes", {1e-15, 4e-15, 2.3e-16, 2.3e-16, 2e-14, -1, 2e-14, -1}},
  };
  return table;
}

TEST(Moments, CompensatedFormsAgainstExactArithmetic) {
  for (const auto& c : singleColumns()) {
    SCOPED_TRACE(c.name);
    const auto& x = c.x;
    const unsigned n = x.size();
    const Bounds& b = bounds().at(c.name);
    auto error = [&](double actual, const char* quantity) {
      return relativeError(actual, reference(c.name, quantity));
    };

    double mean, variance, skewness, kurtosis, sums[4];
    qel::v1::GetSampleMeanAndVariance(x.data(), n, &mean, &variance);
    EXPECT_LE(error(qel::v1::GetSum(x.data(), n), "sum"), b.sum);
    EXPECT_LE(error(mean, "mean"), b.mean);
    EXPECT_LE(error(variance, "variance"), b.variance);
    // The separate forms run the same update.
    EXPECT_EQ(qel::v1::GetSampleMean(x.data(), n), mean);
    EXPECT_EQ(qel::v1::GetSampleVariance(x.data(), n), variance);
    double m, sd;
    qel::v1::CalculateMeanAndStdDev(x.data(), n, &m, &sd);
    EXPECT_EQ(m, mean);
    EXPECT_EQ(sd, std::sqrt(variance));
    // With a centre near the mean, the shifted sums lose almost nothing.
    EXPECT_LE(error(qel::v1::GetSampleVariance(x.data(), n, x[0]), "variance"), 2.3e-16);

    EXPECT_EQ(qel::v1::GetCenteredOrderKPowerSums(x.data(), n, sums, 4), qel::qelOk);
    EXPECT_EQ(sums[0], mean);
    EXPECT_LE(error(sums[1], "m2"), b.m2);
    EXPECT_LE(error(sums[2], "m3"), b.m3);
    qel::v1::GetLynSkewnessAndKurtosis(x.data(), n, &skewness, &kurtosis);
    EXPECT_LE(error(skewness, "skewness"), b.skewness);
    if (b.m4 > 0) {
      EXPECT_LE(error(sums[3], "m4"), b.m4);
      EXPECT_LE(error(kurtosis, "kurtosis"), b.kurtosis);
    }

    std::vector<double> running(n);
    qel::v1::GetCumulativeSums(x.data(), n, running.data());
    EXPECT_LE(error(running.back(), "sum"), b.sum);
  }
}

TEST(Moments, CovarianceAndCorrelationAgainstExactArithmetic) {
  std::vector<double> x, y;
  qeltest::pairData(10000, 2, x, y);
  const unsigned n = x.size();
  double varianceX = 0.0, varianceY = 0.0, sumSqX, sumSqY;
  const double covariance = qel::v1::GetCovariance(x.data(), y.data(), n, &varianceX, &varianceY);
  EXPECT_LE(relativeError(covariance, reference("pair", "covariance")), 8e-9);
  EXPECT_LE(relativeError(varianceX * (n - 1.0), reference("pair", "sxx")), 8e-9);
  EXPECT_LE(relativeError(varianceY * (n - 1.0), reference("pair", "syy")), 5e-9);
  const double sxy = qel::v1::GetCenteredCrossProduct(x.data(), y.data(), n, &sumSqX, &sumSqY);
  EXPECT_LE(relativeError(sxy, reference("pair", "sxy")), 8e-9);
  EXPECT_LE(relativeError(sumSqX, reference("pair", "sxx")), 8e-9);
  const double r = qel::v1::GetPearsonCorrelation(x.data(), y.data(), n);
  EXPECT_LT(r, 0.0);
  EXPECT_LE(relativeError(r, reference("pair", "pearson")), 1e-8);

  qeltest::tiesData(500, 4, x, y);
  EXPECT_LE(relativeError(qel::v1::GetPearsonCorrelation(x.data(), y.data(), 500),
                          reference("ties", "pearson")),
            5e-16);
  int status = -1;
  EXPECT_LE(relativeError(qel::v1::GetSpearmanCorrelation(x.data(), y.data(), 500, &status),
                          reference("ties", "spearman")),
            5e-16);
  EXPECT_EQ(status, qel::qelOk);
}

}  // namespace
