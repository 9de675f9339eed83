// The studentized maximum and maximum modulus against mpmath integrals
// (tools/reference/gen_studentized_maximum.py), their critical values,
// brackets, lambda handling, bad input and the floating-point state.
#include <gtest/gtest.h>

#include <algorithm>
#include <cfenv>
#include <cmath>
#include <sstream>
#include <string>
#include <vector>

#include "fpu_state.h"
#include "qel/distributions.h"
#include "reference_data.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/studentized_maximum.h"

namespace {

using qeltest::relativeError;

struct Case {
  bool modulus;
  std::vector<double> lambdas;
  double df, x, upper;
  int line;
};

std::vector<Case> loadCases() {
  std::vector<Case> cases;
  for (const auto& row : qeltest::loadReferenceData("studentized_maximum_mp.csv", 2)) {
    Case c{row.text[0] == "mod", {}, row.numbers[0], row.numbers[1], row.numbers[2], row.line};
    std::stringstream in(row.text[1]);
    std::string item;
    while (std::getline(in, item, ';')) c.lambdas.push_back(std::stod(item));
    cases.push_back(c);
  }
  return cases;
}

double pValue(bool modulus, double x, double df, const std::vector<double>& l) {
  const auto n = static_cast<unsigned>(l.size());
  return modulus ? qel::GetStudentizedMaximumModulusPValue(x, df, l.data(), n)
                 : qel::GetStudentizedMaximumPValue(x, df, l.data(), n);
}

double critValue(bool modulus, double alpha, double df, const std::vector<double>& l) {
  const auto n = static_cast<unsigned>(l.size());
  return modulus ? qel::GetStudentizedMaximumModulusCritValue(alpha, df, l.data(), n)
                 : qel::GetStudentizedMaximumCritValue(alpha, df, l.data(), n);
}

// 1e-9 absolute and 1e-7 relative, through the exported functions, each
// leaving the default floating-point state.
TEST(StudentizedMaximum, UpperTailMatchesMpmath) {
  const auto cases = loadCases();
  ASSERT_EQ(cases.size(), 294u);
  for (const Case& c : cases) {
    const double p = pValue(c.modulus, c.x, c.df, c.lambdas);
    // Read before the checks' own arithmetic raises the inexact flag.
    EXPECT_TRUE(qeltest::isDefaultState()) << c.line;
    EXPECT_LE(std::fabs(p - c.upper), 1e-9) << c.line;
    EXPECT_LE(relativeError(p, c.upper), 1e-7) << c.line;
  }
}

// Ten distinct lambdas 0.1 .. 0.9 (tools/reference/gen_studentized_maximum_ten.py)
// from the centre to far upper tails, where the z-lattice ends early.
TEST(StudentizedMaximum, TenDistinctLambdasMatchMpmath) {
  const std::vector<double> ten{0.1, 0.2, 0.3, 0.4, 0.5, 0.6, 0.7, 0.8, 0.85, 0.9};
  const auto rows = qeltest::loadReferenceData("studentized_maximum_ten_mp.csv", 1);
  ASSERT_EQ(rows.size(), 5u);
  for (const auto& row : rows) {
    const double p = pValue(row.text[0] == "mod", row.numbers[1], row.numbers[0], ten);
    EXPECT_LE(std::fabs(p - row.numbers[2]), 1e-9) << row.line;
    EXPECT_LE(relativeError(p, row.numbers[2]), 1e-7) << row.line;
  }
}

// Lambdas 0.99 to 0.9999 repeated up to 100 times, alone and mixed
// (tools/reference/gen_studentized_maximum_near1.py): the narrow steps in z
// of the factors, sharpened by their powers, set the z-lattice.
TEST(StudentizedMaximum, RepeatedLambdasNearOneMatchReference) {
  const auto rows = qeltest::loadReferenceData("studentized_maximum_near1_mp.csv", 2);
  ASSERT_EQ(rows.size(), 120u);
  for (const auto& row : rows) {
    std::vector<double> l;
    std::stringstream in(row.text[1]);
    std::string group;
    while (std::getline(in, group, '+')) {
      const size_t star = group.find('*');
      l.insert(l.end(), std::stoul(group.substr(star + 1)), std::stod(group.substr(0, star)));
    }
    const double p = pValue(row.text[0] == "mod", row.numbers[1], row.numbers[0], l);
    EXPECT_LE(std::fabs(p - row.numbers[2]), 1e-9) << row.line;
    EXPECT_LE(relativeError(p, row.numbers[2]), 1e-7) << row.line;
  }
}

// The order of the lambdas does not matter; for the modulus neither does
// their sign.
TEST(StudentizedMaximum, LambdaOrderAndSign) {
  int checked = 0;
  for (const Case& c : loadCases()) {
    if (c.lambdas.size() < 5 || c.lambdas[0] == c.lambdas[1]) continue;
    std::vector<double> l(c.lambdas);
    std::reverse(l.begin(), l.end());
    std::rotate(l.begin(), l.begin() + 2, l.end());
    const double p = pValue(c.modulus, c.x, c.df, c.lambdas);
    EXPECT_EQ(pValue(c.modulus, c.x, c.df, l), p) << c.line;
    ++checked;
    if (!c.modulus) continue;
    for (double& v : l) v = -v;
    EXPECT_LE(relativeError(pValue(true, c.x, c.df, l), p), 1e-13) << c.line;
  }
  EXPECT_GE(checked, 20);
}

// The critical value at level P(x) is x rounded to two decimals (away from
// rounding borders); count 1 is Student's t quantile, unrounded. The
// brackets of the search hold the root.
TEST(StudentizedMaximum, CriticalValuesAndBrackets) {
  int searched = 0;
  for (const Case& c : loadCases()) {
    if (c.upper < 0.001 || c.upper > 0.3) continue;
    const double p = 1.0 - c.upper;
    const int k = static_cast<int>(c.lambdas.size());
    double lower = 0, upper = 0;
    c.modulus ? qel::mBDMCC2(k, c.df, p, &lower, &upper) : qel::mBDMCB1(k, c.df, p, &lower, &upper);
    EXPECT_LE(lower, c.x * (1 + 1e-9)) << c.line;
    EXPECT_GE(upper, c.x * (1 - 1e-9)) << c.line;
    if (k == 1) {
      EXPECT_LE(relativeError(critValue(c.modulus, c.upper, c.df, c.lambdas), c.x), 1e-9) << c.line;
      continue;
    }
    const double scaled = 100 * c.x;
    if (std::fabs(scaled - std::floor(scaled) - 0.5) < 0.02 || (c.df != 5 && c.df != 30)) continue;
    EXPECT_EQ(critValue(c.modulus, c.upper, c.df, c.lambdas), std::round(scaled) / 100) << c.line;
    ++searched;
  }
  EXPECT_GE(searched, 20);
}

// Far tails and limits: df in the millions meets df = inf (the chi density
// without cancellation); lambdas next to 1 make the variables one.
TEST(StudentizedMaximum, Limits) {
  const std::vector<double> l{0.3, 0.6, 0.6};
  for (bool modulus : {false, true}) {
    const double known = pValue(modulus, 2.5, INFINITY, l);
    EXPECT_LE(std::fabs(pValue(modulus, 2.5, 1e12, l) - known), 1e-10);
    const double big = pValue(modulus, 2.5, 1e6, l);
    EXPECT_GT(std::fabs(big - known), 1e-8);  // the 1/df effect is still there
    EXPECT_LE(std::fabs(big - known), 1e-5);
    const std::vector<double> one{0.9999999, 0.9999999};
    EXPECT_LE(relativeError(pValue(modulus, 2.5, 10, one), pValue(modulus, 2.5, 10, {0.0})), 1e-3);
  }
  // P(max > 0) for lambdas 1/sqrt(2), sigma known: 1 - 1/(k + 1) (the
  // variables are exchangeable with a common normal).
  const std::vector<double> half(4, std::sqrt(0.5));
  EXPECT_LE(std::fabs(pValue(false, 0.0, INFINITY, half) - 0.8), 1e-12);
  EXPECT_EQ(pValue(false, -INFINITY, 10, half), 1.0);
  EXPECT_EQ(pValue(true, INFINITY, 10, half), 0.0);
  EXPECT_EQ(pValue(true, 0.0, 10, half), 1.0);
}

TEST(StudentizedMaximum, BadInput) {
  const double missing = qel::mGetMissingValueCode();
  const double nan = std::nan("");
  const double good[] = {0.5, 0.7};
  const double bad[][2] = {{0.5, 1.0}, {-1.0, 0.2}, {nan, 0.2}, {0.5, 2.0}};
  // x or alpha, df, lambda pair (index into bad, or -1 for good), count.
  const double rows[][4] = {
      {2, 10, 0, 2},  {2, 10, 1, 2},   {2, 10, 2, 2},    {2, 10, 3, 2},  {2, 0, -1, 2},
      {2, -1, -1, 2}, {2, nan, -1, 2}, {nan, 10, -1, 2}, {2, 10, -1, 0}, {0.5, -INFINITY, -1, 2}};
  for (bool modulus : {false, true}) {
    for (const auto& r : rows) {
      const double* l = r[2] < 0 ? good : bad[int(r[2])];
      const auto n = static_cast<unsigned>(r[3]);
      for (int crit = 0; crit < 2; ++crit) {
        const double v =
            crit ? (modulus ? qel::GetStudentizedMaximumModulusCritValue(0.05, r[1], l, n)
                            : qel::GetStudentizedMaximumCritValue(0.05, r[1], l, n))
                 : (modulus ? qel::GetStudentizedMaximumModulusPValue(r[0], r[1], l, n)
                            : qel::GetStudentizedMaximumPValue(r[0], r[1], l, n));
        if (crit && r[0] != 2) continue;  // NaN x concerns the P-value only
        EXPECT_EQ(v, missing) << modulus << " " << r[0] << " " << r[1] << " " << r[2];
        EXPECT_TRUE(qeltest::isDefaultState());
      }
    }
    for (double alpha : {0.0, 1.0, -0.5, 1.5, nan})
      EXPECT_EQ(critValue(modulus, alpha, 10, {0.5, 0.7}), missing);
    EXPECT_EQ(pValue(modulus, 2, 10, {}), missing);
    EXPECT_EQ(modulus ? qel::GetStudentizedMaximumModulusPValue(2, 10, nullptr, 2)
                      : qel::GetStudentizedMaximumPValue(2, 10, nullptr, 2),
              missing);
    EXPECT_TRUE(qeltest::isDefaultState());
  }
}

TEST(StudentizedMaximum, TablesAndLambdas) {
  std::vector<double> distinct;
  std::vector<unsigned> counts;
  EXPECT_EQ(qel::mConsolidateLambdas({0.5, -0.2, 0.5, 0.0, 0.5, -0.2}, distinct, counts), 0);
  EXPECT_EQ(distinct, (std::vector<double>{-0.2, 0.0, 0.5}));
  EXPECT_EQ(counts, (std::vector<unsigned>{2, 1, 3}));
  // Gauss-Hermite 48: int x^(2j) exp(-x^2) dx = Gamma(j + 1/2) for 2j < 96.
  double nodes[48], weights[48];
  ASSERT_TRUE(qel::mGHArrayInit(nodes, weights));
  for (int j = 0; j < 12; ++j) {
    double sum = 0;
    for (int i = 0; i < 48; ++i) sum += weights[i] * std::pow(nodes[i], 2 * j);
    EXPECT_LE(relativeError(sum, std::tgamma(j + 0.5)), 1e-12) << j;
  }
  // Phi at the 97.5 and 0.1 percent points (mpmath).
  const double z[] = {1.959963984540054, -3.090232306167813};
  double out[2];
  qel::mNCDFV(2, z, out);
  EXPECT_LE(relativeError(out[0], 0.975), 1e-15);
  EXPECT_LE(relativeError(out[1], 0.001), 1e-13);
}

}  // namespace
