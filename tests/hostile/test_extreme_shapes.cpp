// Densities and tails of the gamma, chi-square, beta, F and t laws at shapes
// from 1e-300 to 1e300 against mpmath (tools/reference/gen_extreme_shapes.py
// -> tests/data/extreme_shapes.csv): within 1e-12 relative plus what one
// rounding of the inputs causes (8 eps times the condition number written
// beside each row), below DBL_MIN where the truth underflows, NaN only where
// the truth exceeds the double range. Where the condition number exceeds
// 1e14 the double inputs do not determine the density (a shape of 1e300 puts
// 1e33 standard deviations between neighbouring doubles) and only the range
// is checked.
//
// Open, left to the owners of the gamma and beta tails: below x = 2.2e-288
// the ELV gamma and beta routines answer a lower tail of 0 (truth about
// x^a / (a B(a, b)), e.g. 1.1e-150 at x = 1e-300, a = 0.5); those rows are
// checked for range only.
#include <gtest/gtest.h>
#include <qel/distributions.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdlib>
#include <fstream>
#include <map>
#include <sstream>
#include <string>

namespace {

double call(const std::string& family, const std::string& function, double x, double p1,
            double p2) {
  using namespace qel;
  const bool pdf = function == "pdf", upper = function == "upper";
  if (family == "gamma" || family == "gammascale")
    return pdf ? GammaPdf(x, p1, p2, 0.0) : GammaCdf(x, p1, p2, 0.0, upper);
  if (family == "chisq") return pdf ? ChiSqPdf(x, p1) : ChiSqCdf(x, p1, 0.0, upper);
  if (family == "beta") return pdf ? BetaPdf(x, p1, p2) : BetaCdf(x, p1, p2, upper);
  if (family == "f") return pdf ? FPdf(x, p1, p2) : FCdf(x, p1, p2, 0.0, upper);
  return pdf ? TPdf(x, p1, 0.0) : TCdf(x, p1, 0.0, upper);
}

TEST(ExtremeShapes, DensitiesAndTailsMatchMpmath) {
  std::ifstream in(std::string(QEL_TEST_DATA_DIR) + "/extreme_shapes.csv");
  ASSERT_TRUE(in.good());
  qel::RegisterLynSigfpeHandler();
  std::string line;
  std::map<std::string, int> rows, failures;
  while (std::getline(in, line)) {
    if (line.empty() || line[0] == '#') continue;
    std::istringstream s(line);
    std::string family, function, field[5];
    std::getline(s, family, ',');
    std::getline(s, function, ',');
    for (auto& f : field) std::getline(s, f, ',');
    // strtod: the truth may be denormal, which stod refuses.
    const double x = std::stod(field[0]), p1 = std::stod(field[1]), p2 = std::stod(field[2]);
    const double truth = std::strtod(field[3].c_str(), nullptr),
                 kappa = std::strtod(field[4].c_str(), nullptr);
    double r;
    try {
      r = call(family, function, x, p1, p2);
    } catch (const std::exception& e) {  // a trap that reached the host
      qel::ResetFpuStates();
      r = -1.0;
    }
    const bool open = function == "lower" && family != "t" && x < 2.2250738585072014e-288;
    const bool ok = open || kappa > 1e14 ? r >= 0.0 && r <= std::max(truth, DBL_MAX)
                    : truth > DBL_MAX    ? std::isnan(r) || std::isinf(r)
                    : truth < DBL_MIN
                        ? r >= 0.0 && r <= DBL_MIN
                        : std::fabs(r - truth) <= (1e-12 + 8 * DBL_EPSILON * kappa) * truth;
    ++rows[family + " " + function];
    if (!ok && failures[family + " " + function]++ < 10)
      ADD_FAILURE() << family << ' ' << function << '(' << line << ") = " << r;
  }
  for (const auto& [what, count] : rows) EXPECT_EQ(failures[what], 0) << what << " of " << count;
}

}  // namespace

// The noncentral F at df1 down to 1e-300 (tools/reference/gen_extreme_shapes.py
// -> noncentral_f_small_df.csv): both tails to 1e-12, and quantiles that
// give back p, or 0 where p is within the mass below the smallest double.
TEST(ExtremeShapes, NoncentralFAtVanishingNumeratorDf) {
  std::ifstream in(std::string(QEL_TEST_DATA_DIR) + "/noncentral_f_small_df.csv");
  ASSERT_TRUE(in.good());
  std::string line;
  int rows = 0;
  while (std::getline(in, line)) {
    if (line.empty() || line[0] == '#') continue;
    double v[6];
    std::istringstream s(line);
    for (double& d : v) {
      std::string field;
      std::getline(s, field, ',');
      d = std::strtod(field.c_str(), nullptr);
    }
    const double x = v[0], m = v[1], n = v[2], ncp = v[3];
    ++rows;
    EXPECT_NEAR(qel::FCdf(x, m, n, ncp, false), v[4], 1e-12 * v[4]) << line;
    EXPECT_NEAR(qel::FCdf(x, m, n, ncp, true), v[5], 1e-12 * v[5]) << line;
    if (v[4] >= 1.0) continue;  // no quantile of 1 in the positive reals
    const double q = qel::FInvCdf(v[4], m, n, ncp);
    const double p = qel::FCdf(q == 0.0 ? DBL_MIN : q, m, n, ncp, false);
    if (q == 0.0) {
      EXPECT_GE(p, v[4] * (1.0 - 1e-12)) << "inv " << line;
    } else {
      EXPECT_NEAR(p, v[4], 1e-9 * v[4]) << "inv " << line << " = " << q;
    }
  }
  EXPECT_GT(rows, 100);
}
