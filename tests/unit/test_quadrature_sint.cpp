// Gauss rules against mpmath (tools/reference/gen_gauss_rules.py) and the
// published Gauss-Legendre tables (tests/data/gauss_legendre.txt), exactness
// on monomials, and the sign confidence levels against exact binomial sums
// (tools/reference/gen_sint.py).
#include <gtest/gtest.h>

#include <cmath>
#include <fstream>
#include <map>
#include <string>
#include <vector>

#include "reference_data.h"
#include "utilities/MathUtilities.h"
#include "utilities/RootsAndOptima.h"

namespace {

using qeltest::relativeError;

struct Power : qel::CmRealFunction {
  int k;
  explicit Power(int k) : k(k) {}
  double operator()(double x) override { return std::pow(x, k); }
};

TEST(GaussRules, LegendreMatchesPublishedTables) {
  std::ifstream in(std::string(QEL_TEST_DATA_DIR) + "/gauss_legendre.txt");
  std::string line;
  int tables = 0;
  while (std::getline(in, line)) {
    if (line.compare(0, 21, "table gauss_legendre_") != 0) continue;
    const unsigned n = std::stoul(line.substr(21));
    std::vector<double> x, w;
    ASSERT_TRUE(qel::mGaussianQuadratureWeights(n, x, w) && x.size() == n / 2);
    for (unsigned i = 0; i < n / 2; ++i) {
      double node, weight;
      in >> node >> weight;
      EXPECT_TRUE(std::fabs(x[i] - node) <= 1e-15 && relativeError(w[i], weight) <= 1e-13) << n;
    }
    ++tables;
  }
  EXPECT_EQ(tables, 2);
}

TEST(GaussRules, MatchMpmathAndAreExactOnMonomials) {
  std::map<std::string, std::vector<qeltest::Row>> rules;
  for (const auto& row : qeltest::loadReferenceData("gauss_rules.csv", 1)) {
    rules[row.text[0] + " " + std::to_string(row.numbers[0]) + " " + std::to_string(row.numbers[1])]
        .push_back(row);
  }
  ASSERT_EQ(rules.size(), 29u);
  for (const auto& r : rules) {
    const std::string family = r.second[0].text[0];
    const double alpha = r.second[0].numbers[0];
    const auto n = static_cast<unsigned>(r.second[0].numbers[1]);
    std::vector<double> x, w;
    ASSERT_TRUE(family == "hermite"    ? qel::mGaussHermiteQuadratureWeights(n, x, w, false)
                : family == "laguerre" ? qel::mGaussLaguerreQuadratureWeights(n, x, w, alpha)
                                       : qel::mGaussianQuadratureWeights(n, x, w));
    const bool legendre = family == "legendre";
    // Legendre keeps the positive half, descending.
    const std::size_t offset = legendre ? n - n / 2 : 0;
    ASSERT_EQ(x.size(), n - offset) << r.first;
    double wMax = 0, xMax = 1;
    for (const auto& row : r.second) {
      wMax = std::max(wMax, row.numbers[3]);
      xMax = std::max(xMax, std::fabs(row.numbers[2]));
    }
    for (std::size_t i = 0; i < x.size(); ++i) {
      const auto& ref = r.second[legendre ? n - 1 - i : i].numbers;
      EXPECT_NEAR(x[i], ref[2], 4e-15 * xMax) << r.first << " " << i;
      // Golub-Welsch weights carry an absolute error of about eps times
      // the largest.
      if (ref[3] > 1e-10 * wMax)
        EXPECT_LE(relativeError(w[i], ref[3]), 1e-11) << r.first << i;
      else
        EXPECT_NEAR(w[i], ref[3], 1e-14 * wMax) << r.first << " " << i;
    }
    // Exact on x^k for k <= 2n - 1 (Legendre: the integral over [-1, 1]).
    for (int k = 0; k < 2 * int(n) && k <= 40; ++k) {
      Power f(k);
      double sum = 0, exact = 0;
      if (family == "hermite") {
        sum = qel::mGaussHermiteIntegration(x, w, f);
        exact = k % 2 ? 0.0 : std::tgamma((k + 1) / 2.0);
      } else if (family == "laguerre") {
        sum = qel::mGaussLaguerreIntegration(x, w, f);
        exact = std::tgamma(k + alpha + 1);
      } else {
        sum = qel::mGaussianIntegration(-1, 1, x, w, f);
        // An odd n loses its middle node, which carries x^0 alone.
        exact = k % 2 ? 0.0 : 2.0 / (k + 1) - (n % 2 && k == 0 ? r.second[n / 2].numbers[3] : 0);
      }
      // Odd moments cancel: the error scale is sum |w x^k|.
      double scale = 1;
      for (std::size_t i = 0; i < x.size(); ++i) scale += std::fabs(w[i] * f(x[i]));
      EXPECT_NEAR(sum, exact, 1e-13 * scale * (k + 1)) << r.first << " k " << k;
    }
  }
  // Bad arguments: alpha <= -1 or NaN; n = 0 is an empty rule.
  std::vector<double> x{1}, w{1};
  EXPECT_FALSE(qel::mGaussLaguerreQuadratureWeights(4, x, w, -1.0) || !x.empty() ||
               qel::mGaussLaguerreQuadratureWeights(4, x, w, std::nan("")));
  EXPECT_TRUE(qel::mGaussHermiteQuadratureWeights(0, x, w, false) && x.empty());
  Power cube(3);
  EXPECT_NEAR(qel::mGaussianIntegration(0, 2, cube, 16), 4.0, 1e-14);
  EXPECT_NEAR(qel::mGaussianIntegration(0, 2, cube, 40), 4.0, 1e-14);
}

TEST(SignLevels, MatchExactBinomialSums) {
  const auto rows = qeltest::loadReferenceData("sint.csv", 0);
  ASSERT_GT(rows.size(), 300u);
  for (const auto& row : rows) {
    const auto& v = row.numbers;
    std::vector<double> levels;
    int d = 0, kind = -1;
    double lambda = -1, pointer[2] = {-1, -1};
    const int n = int(v[0]);
    qel::mSint(n, v[1], levels, &d, &kind, &lambda);
    // Above n = 50 the normal kernel's own error (about 1e-11) shows.
    const double tol = n > 50 ? 1e-10 : 1e-13;
    EXPECT_TRUE(kind == int(v[2]) && d == int(v[3])) << row.line;
    ASSERT_EQ(levels.size(), kind == 1 ? 1u : 2u) << row.line;
    EXPECT_LE(relativeError(levels[0], v[4]), tol) << row.line;
    if (kind != 1) {
      EXPECT_LE(std::fabs(levels[1] - v[5]), tol) << row.line;
    }
    EXPECT_LE(std::fabs(lambda - v[6]), 100 * tol * std::max(1.0, std::fabs(v[6]))) << row.line;
    qel::SINT(&n, &v[1], pointer, &d, &kind, &lambda);
    EXPECT_EQ(pointer[1], kind == 1 ? -1 : levels[1]) << row.line;
  }
}

}  // namespace
