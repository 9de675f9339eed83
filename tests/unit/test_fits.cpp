// The Anderson-Darling statistic against its defining sum, the P-value
// approximations on both sides of their breakpoints, the maximum-likelihood
// fits and their covariance matrices against an independent maximisation
// (tools/reference/gen_fits.py), plotting positions and scores, and bad input.
#include <gtest/gtest.h>
#include <omp.h>
#include <qel/fits.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <map>
#include <string>
#include <vector>

#include "interfaces/basic_statistics/fits.h"
#include "reference_data.h"

namespace {

using qeltest::relativeError;

const double kNaN = std::numeric_limits<double>::quiet_NaN();

const std::map<std::string, std::vector<double>>& samples() {
  static const auto table = [] {
    std::map<std::string, std::vector<double>> t;
    for (const auto& row : qeltest::loadReferenceData("fits_samples.csv", 1))
      t[row.text[0]] = row.numbers;
    return t;
  }();
  return table;
}

// Rows of fits_reference.csv whose quantity is the one asked for.
std::vector<qeltest::Row> rows(const std::string& quantity) {
  static const auto all = qeltest::loadReferenceData("fits_reference.csv", 2);
  std::vector<qeltest::Row> out;
  for (const auto& row : all)
    if (row.text[1] == quantity) out.push_back(row);
  return out;
}

const std::vector<double>& sample(const qeltest::Row& row) {
  return samples().at(row.text[0]);
}
unsigned size(const std::vector<double>& x) {
  return static_cast<unsigned>(x.size());
}

// The statistic of each family, its parameters in front of the reference
// value in the row.
using ADTest = int (*)(double const*, double const*, double*, double*, unsigned);
int exponentialAD(double const* x, double const* scale, double* a2, double* p, unsigned n) {
  return qel::v0::RunLynExponentialADTest(x, *scale, a2, p, n);
}
const std::map<std::string, std::pair<ADTest, int>> kADTests = {
    {"ad_normal", {qel::v1::RunLynNormalADTest, 2}},
    {"ad_lognormal", {qel::v1::RunLynLogNormalADTest, 2}},
    {"ad_exponential", {exponentialAD, 1}},
    {"ad_weibull", {qel::v0::RunLynWeibullADTest, 2}}};

// The statistic to 2e-10 (the running mean of terms near n and the final
// -(S + n) cost digits; the normal distribution function brings its own
// error). The bimodal sample's statistics lie beyond the approximations: the
// P-value is the bound of the last piece, with its warning.
TEST(AndersonDarling, StatisticAgainstTheDefiningSum) {
  int checked = 0;
  const std::map<std::string, double> bounds = {{"ad_normal", 0.005}, {"ad_weibull", 0.01}};
  for (const auto& [quantity, test] : kADTests) {
    for (const auto& row : rows(quantity)) {
      const auto& x = sample(row);
      double a2 = 0, p = 0;
      const int code = test.first(x.data(), row.numbers.data(), &a2, &p, size(x));
      EXPECT_LE(relativeError(a2, row.numbers[test.second]), 2e-10)
          << quantity << " " << row.text[0];
      if (row.text[0] == "bimodal") {
        EXPECT_EQ(code, qel::qelWarnADPValueUpperBound) << quantity;
        EXPECT_EQ(p, bounds.at(quantity));
      }
      ++checked;
    }
  }
  EXPECT_GE(checked, 16);
}

TEST(AndersonDarling, LargeStatisticsGiveBounds) {
  int status = 0;
  EXPECT_EQ(qel::v1::ExponentialADPValue(50.0, &status, 10), 0.0025);
  EXPECT_EQ(status, qel::qelWarnADPValueUpperBound);
}

TEST(AndersonDarling, TooSmallSamplesAndNaN) {
  const double x[2] = {1.0, 2.0}, normal[2] = {1.5, 1.0}, weibull[2] = {2.0, 1.5};
  double a2 = 0, p = 0;
  EXPECT_EQ(qel::v1::RunLynNormalADTest(x, normal, &a2, &p, 1), 0);
  EXPECT_TRUE(std::isnan(a2) && std::isnan(p));
  EXPECT_EQ(qel::v0::RunLynWeibullADTest(x, weibull, &a2, &p, 0), 0);
  EXPECT_TRUE(std::isnan(a2) && std::isnan(p));
  EXPECT_EQ(qel::v1::RunLynNormalADTest(x, normal, &a2, &p, 2), 0);
  EXPECT_TRUE(std::isfinite(a2) && std::isfinite(p));

  const double withNaN[3] = {1.0, kNaN, 3.0};
  EXPECT_EQ(qel::v1::RunLynNormalADTest(withNaN, normal, &a2, &p, 3), 0);
  EXPECT_TRUE(std::isnan(a2) && std::isnan(p));
  EXPECT_EQ(qel::v0::RunLynWeibullADTest(withNaN, weibull, &a2, &p, 3), 0);
  EXPECT_TRUE(std::isnan(p));
  int status = -1;
  EXPECT_TRUE(std::isnan(qel::v1::NormalADPValue(kNaN, &status, 5)));
  EXPECT_EQ(status, 0);
  EXPECT_TRUE(std::isnan(qel::v1::ExponentialADPValue(kNaN, &status, 5)));
  EXPECT_EQ(status, 0);
  EXPECT_TRUE(std::isnan(qel::v1::WeibullADPValue(kNaN, &status, 5)));
  EXPECT_EQ(status, 0);
}

// A statistic whose modified value, formed as the approximation forms it, is
// exactly `target`; NaN when no double near target/factor hits it.
double statisticFor(double target, double factor) {
  double a2 = target / factor;
  for (int k = 0; k < 8 && a2 * factor != target; ++k)
    a2 = std::nextafter(a2, a2 * factor < target ? 1e300 : -1e300);
  return a2 * factor == target ? a2 : kNaN;
}

template <class PValue>
void checkPieces(const std::string& family, PValue pvalue, double (*factor)(unsigned)) {
  int checked = 0;
  for (const auto& row : rows("pvalue")) {
    if (row.text[0] != family) continue;
    const unsigned n = 25;
    int status = -1;
    const double p = pvalue(row.numbers[0] / factor(n), &status, n);
    EXPECT_LE(relativeError(p, row.numbers[1]), 1e-9) << family << " A* = " << row.numbers[0];
    EXPECT_EQ(status, 0);
    ++checked;
  }
  for (const auto& row : rows("border")) {
    if (row.text[0] != family) continue;
    // Find an n at which the border is reached exactly.
    double a2 = kNaN;
    unsigned n = 5;
    for (; n < 200 && std::isnan(a2); ++n) a2 = statisticFor(row.numbers[0], factor(n));
    ASSERT_FALSE(std::isnan(a2)) << family << " border " << row.numbers[0];
    int status = -1;
    const double p = pvalue(a2, &status, n - 1);
    EXPECT_LE(relativeError(p, row.numbers[1]), 1e-12) << family << " border " << row.numbers[0];
    EXPECT_EQ(status, 0);
    ++checked;
  }
  EXPECT_GE(checked, 14);
}

double normalFactor(unsigned n) {
  return 1.0 + 0.75 / n + 2.25 / n / n;
}
double exponentialFactor(unsigned n) {
  return 1.0 + 0.6 / n;
}
double weibullFactor(unsigned n) {
  return 1.0 + 0.2 / std::sqrt(static_cast<double>(n));
}

TEST(AndersonDarling, PValuePiecesAndBorders) {
  checkPieces("normal", qel::v1::NormalADPValue, normalFactor);
  checkPieces("exponential", qel::v1::ExponentialADPValue, exponentialFactor);
}

TEST(AndersonDarling, WeibullInterpolationIsContinuous) {
  const double c[5] = {1.038, 0.877, 0.757, 0.637, 0.474};
  const double p[5] = {0.01, 0.025, 0.05, 0.1, 0.25};
  const unsigned n = 16;  // factor 1.05
  int status = -1;
  for (int i = 1; i < 4; ++i) {
    const double below = qel::v1::WeibullADPValue((c[i] - 1e-9) / 1.05, &status, n);
    const double above = qel::v1::WeibullADPValue((c[i] + 1e-9) / 1.05, &status, n);
    EXPECT_NEAR(below, p[i], 1e-8);
    EXPECT_NEAR(above, p[i], 1e-8);
    // Halfway between two critical values, halfway between their levels.
    const double mid = qel::v1::WeibullADPValue((c[i] + c[i + 1]) / 2 / 1.05, &status, n);
    EXPECT_NEAR(mid, (p[i] + p[i + 1]) / 2, 1e-12);
    EXPECT_EQ(status, 0);
  }
  double a2 = kNaN;
  unsigned m = 2;
  for (; m < 400 && std::isnan(a2); ++m) a2 = statisticFor(c[0], weibullFactor(m));
  ASSERT_FALSE(std::isnan(a2));
  EXPECT_NEAR(qel::v1::WeibullADPValue(a2, &status, m - 1), 0.01, 1e-15);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(qel::v1::WeibullADPValue(std::nextafter(a2, 2.0), &status, m - 1), 0.01);
  EXPECT_EQ(status, qel::qelWarnADPValueUpperBound);
  EXPECT_EQ(qel::v1::WeibullADPValue(0.3, &status, n), 0.25);
  EXPECT_EQ(status, qel::qelWarnADPValueLowerBound);
}

TEST(ParameterFits, WeibullAgainstIndependentMaximisation) {
  int checked = 0;
  for (const auto& row : rows("weibull_ml")) {
    const auto& x = sample(row);
    double par[2] = {0, 0};
    EXPECT_EQ(qel::v2::FitWeibull(x.data(), par, size(x)), 0) << row.text[0];
    EXPECT_LE(relativeError(par[0], row.numbers[0]), 1e-11) << row.text[0];
    EXPECT_LE(relativeError(par[1], row.numbers[1]), 1e-11) << row.text[0];
    ++checked;
  }
  EXPECT_GE(checked, 9);
}

TEST(ParameterFits, WeibullCovarianceIsTheInverseObservedInformation) {
  int checked = 0;
  for (const auto& row : rows("weibull_cov")) {
    const auto& x = sample(row);
    std::vector<double> scores(x.size());
    double par[2], cov[3], a2, p;
    qel::v0::RunLynWeibullPPlot(x.data(), scores.data(), nullptr, par, cov, &a2, &p, size(x),
                                qel::kPlotMedianRank);
    for (int k = 0; k < 3; ++k)
      EXPECT_LE(relativeError(cov[k], row.numbers[k]), 1e-8) << row.text[0] << " " << k;
    ++checked;
  }
  EXPECT_GE(checked, 9);
}

TEST(ParameterFits, NormalLogNormalExponential) {
  for (const char* family : {"normal_ml", "lognormal_ml"}) {
    const bool logs = std::string(family) == "lognormal_ml";
    for (const auto& row : rows(family)) {
      const auto& x = sample(row);
      double fit[2], par[2], cov[3], a2, p;
      std::vector<double> scores(x.size()), probabilities(x.size());
      (logs ? qel::v2::FitLynLogNormal : qel::v2::FitLynNormal)(x.data(), fit, size(x));
      (logs ? qel::v1::RunLynLogNormalPPlot : qel::v1::RunLynNormalPPlot)(
          x.data(), scores.data(), probabilities.data(), par, cov, &a2, &p, size(x),
          qel::kPlotMeanRank);
      for (int k = 0; k < 2; ++k) {
        EXPECT_LE(relativeError(fit[k], row.numbers[k]), 1e-13) << row.text[0];
        EXPECT_LE(relativeError(par[k], row.numbers[k]), 1e-13) << row.text[0];
      }
      EXPECT_LE(relativeError(cov[0], row.numbers[2]), 1e-13) << row.text[0];
      EXPECT_EQ(cov[1], 0.0);
      EXPECT_LE(relativeError(cov[2], row.numbers[3]), 2e-10) << row.text[0];
    }
  }
  for (const auto& row : rows("exponential_ml")) {
    const auto& x = sample(row);
    double fit, par, var, a2, p;
    std::vector<double> scores(x.size());
    EXPECT_EQ(qel::v2::FitExponential(x.data(), &fit, size(x)), 0);
    qel::v0::RunLynExponentialPPlot(x.data(), scores.data(), nullptr, &par, &var, &a2, &p, size(x),
                                    qel::kPlotMidpoint);
    EXPECT_LE(relativeError(fit, row.numbers[0]), 1e-14);
    EXPECT_LE(relativeError(par, row.numbers[0]), 1e-14);
    EXPECT_LE(relativeError(var, row.numbers[1]), 1e-14);
  }
}

TEST(ParameterFits, ThreadCountChangesOnlyRounding) {
  const auto& x = samples().at("weib10000");
  double one[2], all[2];
  const int threads = omp_get_max_threads();
  omp_set_num_threads(1);
  qel::v2::FitWeibull(x.data(), one, size(x));
  omp_set_num_threads(std::max(threads, 2));
  qel::v2::FitWeibull(x.data(), all, size(x));
  omp_set_num_threads(threads);
  EXPECT_LE(relativeError(one[0], all[0]), 1e-12);
  EXPECT_LE(relativeError(one[1], all[1]), 1e-12);
}

TEST(ProbabilityPlots, PositionsAndScores) {
  // Median ranks and midpoints are behind the score rows below.
  double p[5];
  EXPECT_EQ(qel::v1::CreatePointProbabilities(p, 5, qel::kPlotMeanRank), 0);
  EXPECT_DOUBLE_EQ(p[4], 5.0 / 6.0);
  EXPECT_EQ(qel::v1::CreatePointProbabilities(p, 5, qel::kPlotStep), 0);
  EXPECT_EQ(p[4], 1.0);
  EXPECT_EQ(qel::v1::CreatePointProbabilities(p, 5, static_cast<qel::PlottingMethod>(4)),
            qel::qelFailBadEnumValue);
  for (double v : p) EXPECT_TRUE(std::isnan(v));
  EXPECT_EQ(qel::v1::CreatePointProbabilities(nullptr, 0, qel::kPlotStep), 0);

  const double x[5] = {0.5, 1.0, 1.5, 2.5, 4.0};
  double scores[5], par[2], a2, pv;
  int checked = 0;
  for (const auto& row : rows("score")) {
    const auto method = row.text[0] == "hazen" ? qel::kPlotMidpoint : qel::kPlotMedianRank;
    const int i = static_cast<int>(row.numbers[0]);
    qel::v1::RunLynNormalPPlot(x, scores, nullptr, par, nullptr, &a2, &pv, 5, method);
    EXPECT_NEAR(scores[i], row.numbers[1], 5e-11 * std::max(1.0, std::fabs(row.numbers[1])));
    qel::v0::RunLynWeibullPPlot(x, scores, nullptr, par, nullptr, &a2, &pv, 5, method);
    EXPECT_NEAR(scores[i], row.numbers[2], 1e-15 * std::max(1.0, std::fabs(row.numbers[2])));
    ++checked;
  }
  EXPECT_EQ(checked, 10);
  // The Kaplan-Meier step puts the last point at probability 1.
  qel::v0::RunLynExponentialPPlot(x, scores, nullptr, par, nullptr, &a2, &pv, 5, qel::kPlotStep);
  EXPECT_TRUE(std::isinf(scores[4]) && scores[4] > 0);
}

TEST(ProbabilityPlots, SmallSamplesNullOutputsAndUnknownMethod) {
  const double x[3] = {2.0, 3.0, 7.0};
  double scores[3], prob[3], par[2], cov[3], a2, p;
  EXPECT_EQ(qel::v1::RunLynNormalPPlot(x, scores, prob, par, cov, &a2, &p, 1, qel::kPlotMidpoint),
            0);
  EXPECT_EQ(par[0], 2.0);
  EXPECT_EQ(par[1], 0.0);
  EXPECT_TRUE(std::isnan(cov[2]) && std::isnan(a2) && std::isnan(p));

  double parNull[2], a2Null, pNull;
  qel::v1::RunLynNormalPPlot(x, scores, nullptr, par, cov, &a2, &p, 3, qel::kPlotMidpoint);
  qel::v1::RunLynNormalPPlot(x, scores, nullptr, parNull, nullptr, &a2Null, &pNull, 3,
                             qel::kPlotMidpoint);
  EXPECT_EQ(par[0], parNull[0]);
  EXPECT_EQ(par[1], parNull[1]);
  EXPECT_EQ(a2, a2Null);
  EXPECT_EQ(p, pNull);

  const auto bad = static_cast<qel::PlottingMethod>(7);
  using Plot = int (*)(double const*, double*, double*, double*, double*, double*, double*,
                       unsigned, qel::PlottingMethod);
  for (Plot plot : {Plot(qel::v1::RunLynNormalPPlot), Plot(qel::v1::RunLynLogNormalPPlot),
                    Plot(qel::v0::RunLynWeibullPPlot)}) {
    EXPECT_EQ(plot(x, scores, prob, par, cov, &a2, &p, 3, bad), qel::qelFailBadEnumValue);
    for (double v : {scores[0], prob[2], par[0], par[1], cov[0], cov[1], cov[2], a2, p})
      EXPECT_TRUE(std::isnan(v));
  }
  EXPECT_EQ(qel::v0::RunLynExponentialPPlot(x, scores, prob, par, cov, &a2, &p, 3, bad),
            qel::qelFailBadEnumValue);
  EXPECT_TRUE(std::isnan(par[0]) && std::isnan(cov[0]) && std::isnan(a2) && std::isnan(p));
}

TEST(ParameterFits, BadInputFlowsThroughWithoutCrashing) {
  double par[2];
  const double constant[4] = {3.0, 3.0, 3.0, 3.0};
  EXPECT_EQ(qel::v2::FitWeibull(constant, par, 4), qel::qelFailNoFit);
  EXPECT_TRUE(std::isnan(par[0]) && std::isnan(par[1]));

  const double withNaN[4] = {1.0, 2.0, kNaN, 4.0};
  EXPECT_EQ(qel::v2::FitWeibull(withNaN, par, 4), qel::qelFailNoFit);
  EXPECT_TRUE(std::isnan(par[0]));

  const double nonpositive[4] = {-1.0, 0.0, 2.0, 5.0};
  qel::v2::FitWeibull(nonpositive, par, 4);
  EXPECT_FALSE(std::isfinite(par[0]) && std::isfinite(par[1]));
  EXPECT_EQ(qel::v2::FitLynLogNormal(nonpositive, par, 4), 0);
  EXPECT_FALSE(std::isfinite(par[0]));

  double scores[4], cov[3], a2, p;
  qel::v0::RunLynWeibullPPlot(nonpositive, scores, nullptr, par, cov, &a2, &p, 4,
                              qel::kPlotMedianRank);
  EXPECT_FALSE(std::isfinite(a2));
  qel::v1::RunLynLogNormalPPlot(nonpositive, scores, nullptr, par, cov, &a2, &p, 4,
                                qel::kPlotMedianRank);
  EXPECT_FALSE(std::isfinite(a2));

  // All values equal: no spread to fit, so the two-parameter tests have no
  // answer, and the status stays 0 (the approximations have no code for it).
  // The exponential has no spread parameter; only all zeros defeat it.
  using Plot = int (*)(double const*, double*, double*, double*, double*, double*, double*,
                       unsigned, qel::PlottingMethod);
  const double zeros[4] = {0.0, 0.0, 0.0, 0.0};
  for (Plot plot : {Plot(qel::v1::RunLynNormalPPlot), Plot(qel::v1::RunLynLogNormalPPlot),
                    Plot(qel::v0::RunLynExponentialPPlot), Plot(qel::v0::RunLynWeibullPPlot)}) {
    for (const double* data : {constant, zeros}) {
      if (plot == Plot(qel::v0::RunLynExponentialPPlot) && data == constant) continue;
      EXPECT_EQ(plot(data, scores, nullptr, par, cov, &a2, &p, 4, qel::kPlotMedianRank), 0);
      EXPECT_TRUE(std::isnan(a2) && std::isnan(p)) << (data == zeros ? "zeros" : "constant");
    }
  }

  // Fewer than two points.
  const double one = 2.5;
  EXPECT_EQ(qel::v2::FitWeibull(&one, par, 1), qel::qelFailNoFit);
  EXPECT_TRUE(std::isnan(par[0]));
  EXPECT_EQ(qel::v2::FitExponential(&one, par, 0), 0);
  EXPECT_TRUE(std::isnan(par[0]));
  qel::v0::RunLynWeibullPPlot(&one, scores, nullptr, par, cov, &a2, &p, 1, qel::kPlotMeanRank);
  EXPECT_TRUE(std::isnan(a2) && std::isnan(p));

  // Unsorted data are taken as they come: the statistic is a number, but not
  // that of the sorted sample.
  const double sorted[4] = {1.0, 2.0, 3.0, 4.5}, unsorted[4] = {3.0, 1.0, 4.5, 2.0};
  const double normal[2] = {2.6, 1.5};
  double a2Sorted;
  qel::v1::RunLynNormalADTest(sorted, normal, &a2Sorted, &p, 4);
  qel::v1::RunLynNormalADTest(unsorted, normal, &a2, &p, 4);
  EXPECT_TRUE(std::isfinite(a2));
  EXPECT_NE(a2, a2Sorted);
}

}  // namespace
