// The closed-form families against mpmath reference values (both tails in
// their own right, densities and quantiles), through the exported functions,
// plus the exact edge values that the frame and kernels promise.
#include <gtest/gtest.h>
#include <qel/distributions.h>

#include <cmath>
#include <functional>
#include <map>
#include <string>

#include "reference_data.h"

namespace {

struct FamilyFunctions {
  std::function<double(double, const double*)> pdf, inv;
  std::function<double(double, const double*, bool)> cdf;
};

const std::map<std::string, FamilyFunctions>& families() {
  static const std::map<std::string, FamilyFunctions> table = {
      {"logistic",
       {[](double x, const double* p) { return qel::LogisticPdf(x, p[0], p[1]); },
        [](double x, const double* p) { return qel::LogisticInvCdf(x, p[0], p[1]); },
        [](double x, const double* p, bool u) { return qel::LogisticCdf(x, p[0], p[1], u); }}},
      {"loglogistic",
       {[](double x, const double* p) { return qel::LogLogisticPdf(x, p[0], p[1], p[2]); },
        [](double x, const double* p) { return qel::LogLogisticInvCdf(x, p[0], p[1], p[2]); },
        [](double x, const double* p, bool u) {
          return qel::LogLogisticCdf(x, p[0], p[1], p[2], u);
        }}},
      {"cauchy",
       {[](double x, const double* p) { return qel::CauchyPdf(x, p[0], p[1]); },
        [](double x, const double* p) { return qel::CauchyInvCdf(x, p[0], p[1]); },
        [](double x, const double* p, bool u) { return qel::CauchyCdf(x, p[0], p[1], u); }}},
      {"triangular",
       {[](double x, const double* p) { return qel::TriangularPdf(x, p[0], p[1], p[2]); },
        [](double x, const double* p) { return qel::TriangularInvCdf(x, p[0], p[1], p[2]); },
        [](double x, const double* p, bool u) {
          return qel::TriangularCdf(x, p[0], p[1], p[2], u);
        }}},
      {"uniform",
       {[](double x, const double* p) { return qel::UniformPdf(x, p[0], p[1]); },
        [](double x, const double* p) { return qel::UniformInvCdf(x, p[0], p[1]); },
        [](double x, const double* p, bool u) { return qel::UniformCdf(x, p[0], p[1], u); }}},
  };
  return table;
}

// Closed forms: at most 1e-14 relative error everywhere, tails included.
constexpr double kTolerance = 1e-14;

TEST(ClosedFormFamilies, MatchHighPrecisionReferenceValues) {
  const auto rows = qeltest::loadReferenceData("closed_form.csv", 2);
  std::map<std::string, int> checked;
  for (const auto& row : rows) {
    const std::string& family = row.text[0];
    const std::string& function = row.text[1];
    const auto it = families().find(family);
    ASSERT_NE(it, families().end()) << "unknown family " << family << " at line " << row.line;
    const double x = row.numbers[0];
    const double* params = &row.numbers[1];
    const double expected = row.numbers[4];
    double actual;
    if (function == "pdf") {
      actual = it->second.pdf(x, params);
    } else if (function == "lower" || function == "upper") {
      actual = it->second.cdf(x, params, function == "upper");
    } else {
      ASSERT_EQ(function, "inv") << "line " << row.line;
      actual = it->second.inv(x, params);
    }
    // The log-logistic tails work on u = log(x - threshold): the rounding of
    // u costs up to |u| / scale units in the last place of a tail (the
    // density carries u to double-double length).
    double tolerance = kTolerance;
    if (family == "loglogistic" && function != "inv" && function != "pdf") {
      tolerance *= 1.0 + std::fabs(std::log(x - params[2])) / params[1] / 50.0;
    }
    EXPECT_LE(qeltest::relativeError(actual, expected), tolerance)
        << family << " " << function << " at x=" << x << " (line " << row.line << "): got "
        << actual << ", expected " << expected;
    ++checked[family + " " + function];
  }
  // Every family was exercised in all four functions.
  EXPECT_EQ(checked.size(), 20u);
}

TEST(ClosedFormFamilies, TinyTailsKeepTheirRelativeAccuracy) {
  // Far tails, each computed in its own right rather than as 1 - the other.
  EXPECT_NEAR(qel::CauchyCdf(-1e300, 0.0, 1.0, false) / (1.0 / (M_PI * 1e300)), 1.0, 1e-14);
  EXPECT_NEAR(qel::CauchyCdf(1e300, 0.0, 1.0, true) / (1.0 / (M_PI * 1e300)), 1.0, 1e-14);
  EXPECT_NEAR(qel::LogisticCdf(690.0, 0.0, 1.0, true) / std::exp(-690.0), 1.0, 1e-13);
  EXPECT_NEAR(qel::LogisticCdf(-690.0, 0.0, 1.0, false) / std::exp(-690.0), 1.0, 1e-13);
  EXPECT_NEAR(qel::CauchyInvCdf(1e-300, 0.0, 1.0) / (-1.0 / (M_PI * 1e-300)), 1.0, 1e-14);
}

TEST(ClosedFormFamilies, ExactEdgeValues) {
  EXPECT_EQ(qel::LogisticCdf(0.0, 0.0, 1.0, false), 0.5);
  EXPECT_EQ(qel::LogisticCdf(0.0, 0.0, 1.0, true), 0.5);
  EXPECT_EQ(qel::LogisticInvCdf(0.5, 3.0, 2.0), 3.0);
  EXPECT_EQ(qel::CauchyInvCdf(0.5, -4.0, 2.0), -4.0);
  EXPECT_TRUE(std::isnan(qel::CauchyInvCdf(1.0, 0.0, 1.0)));
  // Beyond the trigonometric limit the Cauchy quantile has no answer.
  EXPECT_TRUE(std::isnan(qel::CauchyInvCdf(1e7, 0.0, 1.0)));
  EXPECT_EQ(qel::UniformCdf(2.0, 0.0, 1.0, true), 0.0);
  EXPECT_EQ(qel::UniformCdf(-1.0, 0.0, 1.0, true), 1.0);
  EXPECT_EQ(qel::UniformCdf(0.0, 0.0, 1.0, false), 0.0);
  EXPECT_EQ(qel::UniformCdf(0.0, 0.0, 1.0, true), 1.0);
  EXPECT_EQ(qel::UniformInvCdf(0.0, 0.1, 0.7), 0.1);
  EXPECT_EQ(qel::UniformInvCdf(1.0, 0.1, 0.7), 0.7);
  EXPECT_EQ(qel::TriangularInvCdf(1.0, 0.1, 0.2, 0.7), 0.7);
  EXPECT_EQ(qel::TriangularPdf(0.5, 0.0, 0.5, 1.0), 2.0);
  EXPECT_EQ(qel::LogLogisticCdf(1.0, 0.0, 1.0, 1.0, true), 1.0);
  EXPECT_EQ(qel::LogLogisticPdf(0.5, 0.0, 1.0, 1.0), 0.0);
  // A probability outside [0, 1] has no quantile.
  EXPECT_TRUE(std::isnan(qel::LogisticInvCdf(-0.5, 0.0, 1.0)));
  EXPECT_TRUE(std::isnan(qel::TriangularInvCdf(1.5, 0.0, 0.5, 1.0)));
}

TEST(ClosedFormFamilies, ArrayFormsAgreeWithScalarForms) {
  const double x[] = {-3.0, -0.5, 0.0, 0.7, 2.0, 40.0};
  const unsigned long n = sizeof x / sizeof x[0];
  double out[n];
  qel::LogLogisticCdf(out, x, n, 0.5, 2.0, -1.0, true);
  for (unsigned long i = 0; i < n; ++i)
    EXPECT_EQ(out[i], qel::LogLogisticCdf(x[i], 0.5, 2.0, -1.0, true));
  qel::TriangularPdf(out, x, n, -1.0, 0.0, 3.0);
  for (unsigned long i = 0; i < n; ++i) EXPECT_EQ(out[i], qel::TriangularPdf(x[i], -1.0, 0.0, 3.0));
  qel::CauchyCdf(out, x, n, 1.0, 0.5, false);
  for (unsigned long i = 0; i < n; ++i) EXPECT_EQ(out[i], qel::CauchyCdf(x[i], 1.0, 0.5, false));
  qel::UniformPdf(out, x, n, -1.0, 1.0);
  for (unsigned long i = 0; i < n; ++i) EXPECT_EQ(out[i], qel::UniformPdf(x[i], -1.0, 1.0));
}

}  // namespace
