// The descriptive functions at the edges: empty and one-element columns,
// constant data, NaN in the data, orders above four, the odd/even rounds of
// the compensated sum, aliasing of input and output, and ranks with ties.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/descriptive.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <vector>

#include "interfaces/basic_statistics/utilities.h"
#include "reference_data.h"

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr double kSentinel = -777.0;

double reference(const char* dataset, const char* quantity) {
  for (const auto& row : qeltest::loadReferenceData("moments.csv", 2))
    if (row.text[0] == dataset && row.text[1] == quantity) return row.numbers.at(0);
  ADD_FAILURE() << "no reference value " << dataset << "/" << quantity;
  return kNaN;
}

TEST(DescriptiveEdges, EmptyAndSingleColumns) {
  const double one[] = {5.0};
  const double none[] = {kSentinel};  // must not be taken for data
  // Empty: NaN everywhere; one value: itself and a variance of 0.
  for (unsigned n : {0u, 1u}) {
    const double* x = n ? one : none;
    const double mean = n ? 5.0 : kNaN, spread = n ? 0.0 : kNaN;
    double m = kSentinel, v = kSentinel, m2 = kSentinel, sd = kSentinel;
    qel::v1::GetSampleMeanAndVariance(x, n, &m, &v);
    qel::v1::CalculateMeanAndStdDev(x, n, &m2, &sd);
    for (double got : {qel::v1::GetSampleMean(x, n), m, m2})
      EXPECT_TRUE(got == mean || (std::isnan(got) && std::isnan(mean))) << n;
    for (double got :
         {qel::v1::GetSampleVariance(x, n), qel::v1::GetSampleVariance(x, n, 1.0), v, sd})
      EXPECT_TRUE(got == spread || (std::isnan(got) && std::isnan(spread))) << n;
  }

  EXPECT_TRUE(std::isnan(qel::v1::GetSum(none, 0)));
  EXPECT_EQ(qel::v1::GetSum(one, 1), 5.0);
  EXPECT_EQ(qel::v1::GetEventCount(nullptr, 0), 0u);
  const int event[] = {1};
  EXPECT_EQ(qel::v1::GetEventCount(event, 1), 1u);

  // The running and relative sums write nothing for an empty column.
  double out[2] = {kSentinel, kSentinel};
  qel::v1::GetCumulativeSums(one, 0, out);
  qel::v1::GetProportions(one, 0, out);
  EXPECT_EQ(out[0], kSentinel);
  qel::v1::GetCumulativeSums(one, 1, out);
  EXPECT_EQ(out[0], 5.0);
  qel::v1::GetProportions(one, 1, out);
  EXPECT_EQ(out[0], 1.0);
  EXPECT_EQ(out[1], kSentinel);
}

TEST(DescriptiveEdges, PairsWithFewerThanTwoObservations) {
  const double x[] = {1.0}, y[] = {2.0};
  for (unsigned n : {0u, 1u}) {
    double vx = kSentinel, vy = kSentinel;
    EXPECT_TRUE(std::isnan(qel::v1::GetCovariance(x, y, n, &vx, &vy)));
    EXPECT_EQ(vx, kSentinel);
    EXPECT_EQ(vy, kSentinel);
    EXPECT_EQ(qel::v1::GetCenteredCrossProduct(x, y, n, &vx, &vy), 0.0);
    EXPECT_EQ(vx, 0.0);
    EXPECT_EQ(vy, 0.0);
    EXPECT_TRUE(std::isnan(qel::v1::GetPearsonCorrelation(x, y, n)));
    int status = -1;
    EXPECT_TRUE(std::isnan(qel::v1::GetSpearmanCorrelation(x, y, n, &status)));
    EXPECT_EQ(status, qel::qelOk);
  }
}

TEST(DescriptiveEdges, CentralSumsOfOrderK) {
  const double x[] = {1.0, 2.0, 4.0, 8.0, 16.0, 3.0, 5.0, 7.0, 9.0, 11.0};
  double out[6] = {kSentinel, kSentinel, kSentinel, kSentinel, kSentinel, kSentinel};
  // Orders above four: the lower four still come, the rest are NaN.
  EXPECT_EQ(qel::v1::GetCenteredOrderKPowerSums(x, 10, out, 6), qel::qelFailNotImplemented);
  double four[4];
  qel::v1::GetCenteredOrder4PowerSums(x, 10, four);
  for (int i = 0; i < 4; ++i) EXPECT_EQ(out[i], four[i]);
  EXPECT_DOUBLE_EQ(out[0], 6.6);  // mean of the ten
  EXPECT_TRUE(std::isnan(out[4]) && std::isnan(out[5]));

  std::fill(out, out + 6, kSentinel);
  EXPECT_EQ(qel::v1::GetCenteredOrderKPowerSums(x, 10, out, 2), qel::qelOk);
  EXPECT_EQ(out[1], four[1]);
  EXPECT_EQ(out[2], kSentinel);

  std::fill(out, out + 6, kSentinel);
  EXPECT_EQ(qel::v1::GetCenteredOrderKPowerSums(x, 1, out, 6), qel::qelFailNotImplemented);
  EXPECT_EQ(out[0], 1.0);
  EXPECT_EQ(out[1], 0.0);
  EXPECT_EQ(out[3], 0.0);
  EXPECT_TRUE(std::isnan(out[4]) && std::isnan(out[5]));

  std::fill(out, out + 6, kSentinel);
  EXPECT_EQ(qel::v1::GetCenteredOrderKPowerSums(x, 0, out, 3), qel::qelOk);
  EXPECT_TRUE(std::isnan(out[0]) && std::isnan(out[2]));
  EXPECT_EQ(out[3], kSentinel);

  std::fill(out, out + 6, kSentinel);
  EXPECT_EQ(qel::v1::GetCenteredOrderKPowerSums(x, 1, out, 0), qel::qelOk);
  EXPECT_EQ(out[0], kSentinel);

  // The inner order-four form takes x[0] as the mean of fewer than two.
  qel::v1::GetCenteredOrder4PowerSums(x, 0, four);
  EXPECT_EQ(four[0], 1.0);
  EXPECT_EQ(four[1], 0.0);
  EXPECT_EQ(four[3], 0.0);
}

TEST(DescriptiveEdges, SkewnessKurtosisAndSecondMoments) {
  const double small[] = {2, 4, 4, 4, 5, 5, 7, 9};
  double skewness, kurtosis;
  qel::v1::GetLynSkewnessAndKurtosis(small, 8, &skewness, &kurtosis);
  EXPECT_LE(qeltest::relativeError(skewness, reference("small", "skewness")), 4e-16);
  EXPECT_LE(qeltest::relativeError(kurtosis, reference("small", "kurtosis")), 4e-15);

  // Three values give a skewness and no kurtosis; two give neither.
  const double three[] = {1, 2, 10};
  qel::v1::GetLynSkewnessAndKurtosis(three, 3, &skewness, &kurtosis);
  EXPECT_LE(qeltest::relativeError(skewness, reference("three", "skewness")), 4e-16);
  EXPECT_TRUE(std::isnan(kurtosis));
  qel::v1::GetLynSkewnessAndKurtosis(three, 2, &skewness, &kurtosis);
  EXPECT_TRUE(std::isnan(skewness) && std::isnan(kurtosis));

  qel::v1::SecondSampleMoments moments;
  EXPECT_TRUE(std::isnan(moments.variance) && std::isnan(moments.sumOfSquares) &&
              std::isnan(moments.mean) && std::isnan(moments.sum));
  EXPECT_EQ(moments.n, 0u);
  qel::v1::GetSecondSampleMoments(&moments, small);
  EXPECT_TRUE(std::isnan(moments.mean) && std::isnan(moments.sum));
  moments.n = 8;
  qel::v1::GetSecondSampleMoments(&moments, small);
  EXPECT_EQ(moments.mean, 5.0);
  EXPECT_DOUBLE_EQ(moments.variance, 32.0 / 7.0);
  EXPECT_EQ(moments.sum, 40.0);
  EXPECT_DOUBLE_EQ(moments.sumOfSquares, 232.0);
  moments.n = 1;
  qel::v1::GetSecondSampleMoments(&moments, small);
  EXPECT_EQ(moments.sum, 2.0);
  EXPECT_EQ(moments.sumOfSquares, 4.0);
  EXPECT_EQ(moments.variance, 0.0);
}

TEST(DescriptiveEdges, ConstantDataGiveZeroVarianceAndUndefinedShape) {
  const std::vector<double> x(50, 1e9 + 0.125);
  const std::vector<double> y(50, -3.0);
  std::vector<double> z(50);
  for (int i = 0; i < 50; ++i) z[i] = i;
  EXPECT_EQ(qel::v1::GetSampleVariance(x.data(), 50), 0.0);
  EXPECT_EQ(qel::v1::GetSampleMean(x.data(), 50), 1e9 + 0.125);
  EXPECT_EQ(qel::v1::GetSum(y.data(), 50), -150.0);
  double skewness, kurtosis;
  qel::v1::GetLynSkewnessAndKurtosis(x.data(), 50, &skewness, &kurtosis);
  EXPECT_TRUE(std::isnan(skewness) && std::isnan(kurtosis));
  // A constant column has no correlation: NaN, not 0.
  EXPECT_TRUE(std::isnan(qel::v1::GetPearsonCorrelation(x.data(), z.data(), 50)));
  int status = -1;
  EXPECT_TRUE(std::isnan(qel::v1::GetSpearmanCorrelation(z.data(), y.data(), 50, &status)));
  EXPECT_EQ(status, qel::qelOk);
  // Exactly linear columns.
  std::vector<double> w(50);
  for (int i = 0; i < 50; ++i) w[i] = 7.0 - 2.0 * i;
  EXPECT_EQ(qel::v1::GetPearsonCorrelation(z.data(), w.data(), 50), -1.0);
  EXPECT_EQ(qel::v1::GetSpearmanCorrelation(z.data(), w.data(), 50, &status), -1.0);
}

TEST(DescriptiveEdges, NaNFlowsThroughTheArithmetic) {
  const double x[] = {1.0, 2.0, kNaN, 4.0, 5.0};
  const double y[] = {2.0, 1.0, 3.0, 5.0, 4.0};
  double mean, variance, skewness, kurtosis, vx, vy;
  EXPECT_TRUE(std::isnan(qel::v1::GetSampleMean(x, 5)));
  qel::v1::GetSampleMeanAndVariance(x, 5, &mean, &variance);
  EXPECT_TRUE(std::isnan(mean) && std::isnan(variance));
  EXPECT_TRUE(std::isnan(qel::v1::GetSampleVariance(x, 5, 3.0)));
  EXPECT_TRUE(std::isnan(qel::v1::GetSum(x, 5)));
  EXPECT_TRUE(std::isnan(qel::v1::GetSum(x, 4)));
  EXPECT_TRUE(std::isnan(qel::v1::GetCovariance(x, y, 5, &vx, &vy)));
  EXPECT_TRUE(std::isnan(vx));
  EXPECT_EQ(vy, 2.5);
  EXPECT_TRUE(std::isnan(qel::v1::GetPearsonCorrelation(y, x, 5)));
  qel::v1::GetLynSkewnessAndKurtosis(x, 5, &skewness, &kurtosis);
  EXPECT_TRUE(std::isnan(skewness) && std::isnan(kurtosis));
  double running[5];
  qel::v1::GetCumulativeSums(x, 5, running);
  EXPECT_EQ(running[1], 3.0);
  EXPECT_TRUE(std::isnan(running[2]) && std::isnan(running[4]));
}

TEST(DescriptiveEdges, CompensatedSumRounds) {
  // 1 + 2^-53 + 2^-53 is 1 + 2^-52 exactly; a plain sum gives 1.
  const double tiny = std::ldexp(1.0, -53);
  const double even[] = {1.0, tiny, tiny, 0.0};
  const double odd[] = {1.0, tiny, tiny};
  EXPECT_EQ(qel::v1::GetSum(even, 4), 1.0 + 2 * tiny);
  EXPECT_EQ(qel::v1::GetSum(odd, 3), 1.0 + 2 * tiny);
  EXPECT_EQ(qel::v1::GetSum(even, 2), 1.0);
  // Ones after 1e16 (spacing 2 there) each vanish from a plain sum; the
  // carry keeps them.
  std::vector<double> ones(11, 1.0);
  ones[0] = 1e16;
  EXPECT_EQ(qel::v1::GetSum(ones.data(), 11), 1e16 + 10.0);
  EXPECT_EQ(qel::v1::GetSum(ones.data(), 5), 1e16 + 4.0);

  // Running sums, in place.
  double data[] = {1.0, tiny, tiny, 0.5};
  qel::v1::GetCumulativeSums(data, 4, data);
  EXPECT_EQ(data[0], 1.0);
  EXPECT_EQ(data[1], 1.0);
  EXPECT_EQ(data[2], 1.0 + 2 * tiny);
  EXPECT_EQ(data[3], 1.5 + 2 * tiny);

  // Proportions, in place; a zero total gives the infinities of the division.
  double parts[] = {1.0, 2.0, 3.0, 4.0};
  qel::v1::GetProportions(parts, 4, parts);
  EXPECT_DOUBLE_EQ(parts[0], 0.1);
  EXPECT_DOUBLE_EQ(parts[3], 0.4);
  double zero[] = {1.0, -1.0, 0.0};
  qel::v1::GetProportions(zero, 3, zero);
  EXPECT_EQ(zero[0], INFINITY);
  EXPECT_EQ(zero[1], -INFINITY);
  EXPECT_TRUE(std::isnan(zero[2]));

  const int events[] = {1, 0, 1, 1, 0, 1};
  EXPECT_EQ(qel::v1::GetEventCount(events, 6), 4u);
}

TEST(DescriptiveEdges, OrderAndAverageRanks) {
  const double x[] = {3.0, 1.0, 3.0};
  double rank[3];
  EXPECT_EQ(qel::v1::GetRank(x, 3, rank), qel::qelOk);
  EXPECT_EQ(rank[0], 2.5);
  EXPECT_EQ(rank[1], 1.0);
  EXPECT_EQ(rank[2], 2.5);

  const double y[] = {0.5, -2.0, 7.0, 0.25};
  unsigned order[4];
  qel::v1::GetOrder(y, 4, order);
  EXPECT_EQ(order[0], 1u);
  EXPECT_EQ(order[1], 3u);
  EXPECT_EQ(order[2], 0u);
  EXPECT_EQ(order[3], 2u);

  const double tied[] = {4, 4, 4, 4, 1, 9, 9};
  double tiedRank[7];
  EXPECT_EQ(qel::v1::GetRank(tied, 7, tiedRank), qel::qelOk);
  EXPECT_EQ(tiedRank[0], 3.5);
  EXPECT_EQ(tiedRank[3], 3.5);
  EXPECT_EQ(tiedRank[4], 1.0);
  EXPECT_EQ(tiedRank[5], 6.5);

  // NaN never ties: each gets a rank of its own, after the numbers.
  const double withNaN[] = {kNaN, 2.0, kNaN, 1.0, kNaN};
  double nanRank[5];
  EXPECT_EQ(qel::v1::GetRank(withNaN, 5, nanRank), qel::qelOk);
  EXPECT_EQ(nanRank[1], 2.0);
  EXPECT_EQ(nanRank[3], 1.0);
  std::vector<double> nanRanks = {nanRank[0], nanRank[2], nanRank[4]};
  std::sort(nanRanks.begin(), nanRanks.end());
  EXPECT_EQ(nanRanks, (std::vector<double>{3.0, 4.0, 5.0}));

  EXPECT_EQ(qel::v1::GetRank(nullptr, 0, nullptr), qel::qelOk);
}

}  // namespace
