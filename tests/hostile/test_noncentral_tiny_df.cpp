// Noncentral t at df 1e-300..1e-3 (both tails, quantiles) and spot rows of
// the noncentral chi-square and F at such df, against mpmath
// (gen_noncentral_tiny_df.py): 1e-14 relative, 1e-12 for values below 1e-6,
// plus 8 eps times the row's condition number; values below 1e-280 only
// need to stay below it; a quantile beyond the doubles is NaN.
#include <gtest/gtest.h>
#include <qel/distributions.h>

#include <cfloat>
#include <cmath>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace {

double value(const std::vector<std::string>& r) {
  using namespace qel;
  const double x = std::strtod(r[2].c_str(), nullptr), df = std::strtod(r[3].c_str(), nullptr);
  const double df2 = std::strtod(r[4].c_str(), nullptr), ncp = std::strtod(r[5].c_str(), nullptr);
  const bool upper = r[1] == "upper";
  if (r[0] == "chisq") return ChiSqCdf(x, df, ncp, upper);
  if (r[0] == "f") return FCdf(x, df, df2, ncp, upper);
  return r[1] == "inv" ? TInvCdf(x, df, ncp) : TCdf(x, df, ncp, upper);
}

TEST(NoncentralTinyDf, TailsAndQuantilesMatchMpmath) {
  std::ifstream in(std::string(QEL_TEST_DATA_DIR) + "/noncentral_tiny_df.csv");
  int rows = 0, wrong = 0;
  for (std::string line; std::getline(in, line);) {
    if (line.empty() || line[0] == '#') continue;
    std::vector<std::string> r;
    std::istringstream s(line);
    for (std::string f; std::getline(s, f, ',');) r.push_back(f);
    const double truth = std::strtod(r[6].c_str(), nullptr);
    const double kappa = std::strtod(r[7].c_str(), nullptr);
    const double v = value(r);
    const double size = std::fabs(truth);
    const double tolerance =
        (r[1] == "inv" || size < 1e-6 ? 1e-12 : 1e-14) + 8.0 * DBL_EPSILON * kappa;
    const bool ok = std::isnan(truth) ? std::isnan(v)
                    : size < 1e-280   ? std::fabs(v) <= 1e-280
                                      : std::fabs(v - truth) <= tolerance * size;
    ++rows;
    if (!ok && wrong++ < 30) ADD_FAILURE() << line << " -> " << v;
  }
  EXPECT_EQ(wrong, 0) << "of " << rows;
  EXPECT_GT(rows, 600);
}

}  // namespace
