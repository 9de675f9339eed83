// Gamma, chi-square, beta, F, t at shapes 1e-300..1e300 and the noncentral F
// at df1 down to 1e-300 against mpmath (gen_extreme_shapes.py,
// gen_small_shape_tails.py): densities to 1e-12 plus 8 eps times the row's
// condition number (range only beyond 1e14), tails to 1e-12.
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
#include <vector>

namespace {

// Data rows split at commas; numbers by strtod (stod refuses denormals).
std::vector<std::vector<std::string>> rowsOf(const char* file) {
  std::ifstream in(std::string(QEL_TEST_DATA_DIR) + "/" + file);
  std::vector<std::vector<std::string>> rows;
  for (std::string line; std::getline(in, line);) {
    if (line.empty() || line[0] == '#') continue;
    std::istringstream s(line);
    rows.emplace_back();
    for (std::string f; std::getline(s, f, ',');) rows.back().push_back(f);
  }
  return rows;
}

double number(const std::string& s) {
  return std::strtod(s.c_str(), nullptr);
}

double call(const std::string& family, bool pdf, bool upper, double x, double p1, double p2) {
  using namespace qel;
  if (family == "gamma" || family == "gammascale")
    return pdf ? GammaPdf(x, p1, p2, 0.0) : GammaCdf(x, p1, p2, 0.0, upper);
  if (family == "chisq") return pdf ? ChiSqPdf(x, p1) : ChiSqCdf(x, p1, 0.0, upper);
  if (family == "beta") return pdf ? BetaPdf(x, p1, p2) : BetaCdf(x, p1, p2, upper);
  if (family == "f") return pdf ? FPdf(x, p1, p2) : FCdf(x, p1, p2, 0.0, upper);
  return pdf ? TPdf(x, p1, 0.0) : TCdf(x, p1, 0.0, upper);
}

TEST(ExtremeShapes, DensitiesAndTailsMatchMpmath) {
  std::map<std::string, int> rows, failures;
  auto table = rowsOf("extreme_shapes.csv");
  for (auto& r : rowsOf("small_shape_tails.csv")) table.push_back(r);
  for (const auto& r : table) {
    const double x = number(r[2]), truth = number(r[5]), kappa = number(r[6]);
    const double p1 = number(r[3]), p2 = number(r[4]);
    const double v = call(r[0], r[1] == "pdf", r[1] == "upper", x, p1, p2);
    const bool ok = kappa > 1e14      ? v >= 0.0 && v <= std::max(truth, DBL_MAX)
                    : truth > DBL_MAX ? std::isnan(v) || std::isinf(v)
                    : truth < DBL_MIN
                        ? v >= 0.0 && v <= DBL_MIN
                        : std::fabs(v - truth) <= (1e-12 + 8 * DBL_EPSILON * kappa) * truth;
    const std::string what = r[0] + " " + r[1];
    ++rows[what];
    if (!ok && failures[what]++ < 10)
      ADD_FAILURE() << what << " at " << r[2] << ", " << r[3] << ", " << r[4] << " = " << v;
  }
  for (const auto& [what, count] : rows) EXPECT_EQ(failures[what], 0) << what << " of " << count;
  EXPECT_GT(table.size(), 3400u);
}

// Both tails to 1e-12; quantiles give back p, or 0 where p lies within the
// mass below the smallest normal double.
TEST(ExtremeShapes, NoncentralFAtVanishingNumeratorDf) {
  const auto rows = rowsOf("noncentral_f_small_df.csv");
  for (const auto& r : rows) {
    const double x = number(r[0]), m = number(r[1]), n = number(r[2]), ncp = number(r[3]);
    const double lower = number(r[4]), upper = number(r[5]);
    EXPECT_NEAR(qel::FCdf(x, m, n, ncp, false), lower, 1e-12 * lower) << r[0] << ", " << r[1];
    EXPECT_NEAR(qel::FCdf(x, m, n, ncp, true), upper, 1e-12 * upper) << r[0] << ", " << r[1];
    if (lower >= 1.0) continue;  // no quantile of 1 in the positive reals
    const double q = qel::FInvCdf(lower, m, n, ncp);
    const double p = qel::FCdf(q == 0.0 ? DBL_MIN : q, m, n, ncp, false);
    if (q == 0.0) {
      EXPECT_GE(p, lower * (1.0 - 1e-12)) << "inv at " << r[1];
    } else {
      EXPECT_NEAR(p, lower, 1e-9 * lower) << "inv at " << r[1] << " = " << q;
    }
  }
  EXPECT_GT(rows.size(), 100u);
}

}  // namespace

// Quantiles at a shape or df of 1e-300..1e-5 (gen_small_shape_quantiles.py):
// 1e-12 relative in x; exactly 0 where the quantile lies below the smallest
// normal double, NaN where it lies beyond the largest.
TEST(ExtremeShapes, QuantilesAtTinyShapesMatchMpmath) {
  using namespace qel;
  int wrong = 0, count = 0;
  for (const auto& r : rowsOf("small_shape_quantiles.csv")) {
    const double p = number(r[1]), s1 = number(r[2]), s2 = number(r[3]), truth = number(r[4]);
    const std::string& f = r[0];
    const double v = f == "gamma"   ? GammaInvCdf(p, s1, s2, 0.0)
                     : f == "chisq" ? ChiSqInvCdf(p, s1, 0.0)
                     : f == "beta"  ? BetaInvCdf(p, s1, s2)
                     : f == "f"     ? FInvCdf(p, s1, s2, 0.0)
                                    : TInvCdf(p, s1, 0.0);
    const bool ok = std::isnan(truth) ? std::isnan(v)
                    : truth == 0.0    ? v == 0.0
                                      : std::fabs(v - truth) <= 1e-12 * std::fabs(truth);
    ++count;
    if (!ok && wrong++ < 40)
      ADD_FAILURE() << f << " inv " << r[1] << ", " << r[2] << ", " << r[3] << " = " << v;
  }
  EXPECT_EQ(wrong, 0) << "of " << count;
  EXPECT_GT(count, 300);
}

namespace {

// Every exported family at a parameter of 1e6..1e300 (gen_large_parameters.py).
double callLarge(const std::string& f, const std::string& fn, double x, double a, double b,
                 double c) {
  using namespace qel;
  const bool pdf = fn == "pdf", inv = fn == "inv", up = fn == "upper";
  if (f == "gamma")
    return pdf ? GammaPdf(x, a, b, 0) : inv ? GammaInvCdf(x, a, b, 0) : GammaCdf(x, a, b, 0, up);
  if (f == "chisq")
    return pdf ? ChiSqPdf(x, a) : inv ? ChiSqInvCdf(x, a, b) : ChiSqCdf(x, a, b, up);
  if (f == "beta") return pdf ? BetaPdf(x, a, b) : inv ? BetaInvCdf(x, a, b) : BetaCdf(x, a, b, up);
  if (f == "t") return pdf ? TPdf(x, a, b) : inv ? TInvCdf(x, a, b) : TCdf(x, a, b, up);
  if (f == "f") return pdf ? FPdf(x, a, b) : inv ? FInvCdf(x, a, b, c) : FCdf(x, a, b, c, up);
  if (f == "poisson")
    return pdf ? PoissonPdf(x, a) : inv ? PoissonInvCdf(x, a) : PoissonCdf(x, a, up);
  if (f == "binomial") {
    const bool small = a < 2e9;  // Pdf and InvCdf take an int n
    if (!small && (pdf || inv)) return std::nan("");
    return pdf   ? BinomialPdf(x, int(a), b)
           : inv ? BinomialInvCdf(x, int(a), b)
                 : BinomialCdf(x, a, b, up);
  }
  if (f == "negbinomial")
    return pdf   ? NegBinomialPdf(x, a, b)
           : inv ? NegBinomialInvCdf(x, a, b)
                 : NegBinomialCdf(x, a, b, up);
  if (f == "geometric")
    return pdf ? GeometricPdf(x, a) : inv ? GeometricInvCdf(x, a) : GeometricCdf(x, a, up);
  if (f == "normal")
    return pdf ? NormalPdf(x, a, b) : inv ? NormalInvCdf(x, a, b) : NormalCdf(x, a, b, up);
  if (f == "logistic") return pdf ? LogisticPdf(x, a, b) : LogisticCdf(x, a, b, up);
  if (f == "laplace") return pdf ? LaplacePdf(x, a, b) : LaplaceCdf(x, a, b, up);
  if (f == "cauchy") return pdf ? CauchyPdf(x, a, b) : CauchyCdf(x, a, b, up);
  if (f == "lev")
    return pdf ? LargestExtremeValuePdf(x, a, b) : LargestExtremeValueCdf(x, a, b, up);
  if (f == "sev")
    return pdf ? SmallestExtremeValuePdf(x, a, b) : SmallestExtremeValueCdf(x, a, b, up);
  return pdf ? WeibullPdf(x, a, b, 0) : WeibullCdf(x, a, b, 0, up);
}

}  // namespace

// Values to 1e-14 relative (1e-12 where below 1e-6; quantiles in x, by p),
// plus 8 eps times the row's condition number (densities; tails where
// neighbouring doubles of x lie more than a standard deviation apart or x is
// divided by a scale; range only beyond 1e14). Discrete quantiles thus
// exactly below 1e14 (the smallest double at or above the integer quantile);
// true values below 1e-300 as at most 1e-280; counts beyond 2^53 NaN.
TEST(ExtremeShapes, LargeParametersMatchMpmath) {
  std::map<std::string, int> rows, failures;
  for (const auto& r : rowsOf("large_parameters.csv")) {
    const double x = number(r[2]), truth = number(r[6]), kappa = number(r[7]);
    const bool inv = r[1] == "inv";
    if (r[0] == "binomial" && number(r[3]) > 2e9 && (inv || r[1] == "pdf")) continue;
    const double v = callLarge(r[0], r[1], x, number(r[3]), number(r[4]), number(r[5]));
    // Counts n and r are whole numbers up to 2^53: beyond, NaN.
    const double count = r[0] == "binomial"      ? number(r[3])
                         : r[0] == "negbinomial" ? number(r[4])
                                                 : 0.0;
    if (count > 0x1p53) {
      EXPECT_TRUE(std::isnan(v)) << r[0] << " " << r[1] << " at count " << r[3] << ", " << r[4];
      continue;
    }
    const double small = inv ? std::fmin(x, 1.0 - x) : truth;
    const double tol = (small < 1e-6 ? 1e-12 : 1e-14) + 8 * DBL_EPSILON * kappa;
    const bool ok = kappa > 1e14          ? v >= 0.0 && (r[1] == "pdf" || v <= 1.0)
                    : truth == 0.0 && inv ? std::fabs(v) <= 1e-14
                    : truth == 0.0        ? v >= 0.0 && v <= 1e-280
                                          : std::fabs(v - truth) <= tol * std::fabs(truth);
    const std::string what = r[0] + " " + r[1];
    ++rows[what];
    if (!ok && failures[what]++ < 6)
      ADD_FAILURE() << what << " at " << r[2] << "; " << r[3] << ", " << r[4] << ", " << r[5]
                    << " = " << v << " (mpmath " << r[6] << ")";
  }
  for (const auto& [what, count] : rows) EXPECT_EQ(failures[what], 0) << what << " of " << count;
  EXPECT_GT(rows.size(), 40u);
}
