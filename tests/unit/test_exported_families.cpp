// The exported families against mpmath reference values: a few points each
// with asymmetric parameters, so that a wrong kernel or a wrong order of
// arguments shows (exported_families.csv), and the families on the ELV
// routines at double precision from the body out to tails and quantiles of
// 1e-300 (distribution_precision*.csv); the array forms against the scalar
// forms, and the P-value functions.
#include <gtest/gtest.h>
#include <qel/distributions.h>

#include <algorithm>
#include <cctype>
#include <cmath>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "reference_data.h"

namespace {

using Params = const double*;

struct Exported {
  std::function<double(double, Params)> pdf, inv;
  std::function<double(double, Params, bool)> cdf;
  std::function<void(double*, const double*, unsigned long, Params)> pdfArray, invArray;
  std::function<void(double*, const double*, unsigned long, Params, bool)> cdfArray;
};

int I(double v) {
  return static_cast<int>(v);
}

#define QEL_TEST_FAMILY(Name, ...)                                                      \
  {                                                                                     \
#Name, {                                                                            \
      [](double x, Params p) { return qel::Name##Pdf(x, __VA_ARGS__); },                \
          [](double x, Params p) { return qel::Name##InvCdf(x, __VA_ARGS__); },         \
          [](double x, Params p, bool u) { return qel::Name##Cdf(x, __VA_ARGS__, u); }, \
          [](double* o, const double* x, unsigned long n, Params p) {                   \
            qel::Name##Pdf(o, x, n, __VA_ARGS__);                                       \
          },                                                                            \
          [](double* o, const double* x, unsigned long n, Params p) {                   \
            qel::Name##InvCdf(o, x, n, __VA_ARGS__);                                    \
          },                                                                            \
          [](double* o, const double* x, unsigned long n, Params p, bool u) {           \
            qel::Name##Cdf(o, x, n, __VA_ARGS__, u);                                    \
          }                                                                             \
    }                                                                                   \
  }

const std::map<std::string, Exported>& exported() {
  static const std::map<std::string, Exported> table = {
      QEL_TEST_FAMILY(Normal, p[0], p[1]),
      QEL_TEST_FAMILY(LogNormal, p[0], p[1], p[2]),
      QEL_TEST_FAMILY(HalfNormal, p[0], p[1]),
      QEL_TEST_FAMILY(Exponential, p[0], p[1]),
      QEL_TEST_FAMILY(Weibull, p[0], p[1], p[2]),
      QEL_TEST_FAMILY(LargestExtremeValue, p[0], p[1]),
      QEL_TEST_FAMILY(SmallestExtremeValue, p[0], p[1]),
      QEL_TEST_FAMILY(Laplace, p[0], p[1]),
      QEL_TEST_FAMILY(Logistic, p[0], p[1]),
      QEL_TEST_FAMILY(LogLogistic, p[0], p[1], p[2]),
      QEL_TEST_FAMILY(Cauchy, p[0], p[1]),
      QEL_TEST_FAMILY(Triangular, p[0], p[1], p[2]),
      QEL_TEST_FAMILY(Gamma, p[0], p[1], p[2]),
      QEL_TEST_FAMILY(Beta, p[0], p[1]),
      QEL_TEST_FAMILY(Lambda, p[0], p[1], p[2]),
      QEL_TEST_FAMILY(Poisson, p[0]),
      QEL_TEST_FAMILY(NegBinomial, p[0], p[1]),
      QEL_TEST_FAMILY(Geometric, p[0]),
      QEL_TEST_FAMILY(Hypergeometric, I(p[0]), I(p[1]), I(p[2])),
      QEL_TEST_FAMILY(IntegerUniform, I(p[0]), I(p[1])),
  };
  return table;
}

// Families whose functions take different parameter lists.
double chiSq(const std::string& f, double x, Params p) {
  if (f == "pdf") return qel::ChiSqPdf(x, p[0]);
  if (f == "inv") return qel::ChiSqInvCdf(x, p[0], p[1]);
  return qel::ChiSqCdf(x, p[0], p[1], f == "upper");
}
double fDist(const std::string& f, double x, Params p) {
  if (f == "pdf") return qel::FPdf(x, p[0], p[1]);
  if (f == "inv") return qel::FInvCdf(x, p[0], p[1], p[2]);
  return qel::FCdf(x, p[0], p[1], p[2], f == "upper");
}
double tDist(const std::string& f, double x, Params p) {
  if (f == "pdf") return qel::TPdf(x, p[0], p[1]);
  if (f == "inv") return qel::TInvCdf(x, p[0], p[1]);
  return qel::TCdf(x, p[0], p[1], f == "upper");
}
double binomial(const std::string& f, double x, Params p) {
  if (f == "pdf") return qel::BinomialPdf(x, I(p[0]), p[1]);
  if (f == "inv") return qel::BinomialInvCdf(x, I(p[0]), p[1]);
  return qel::BinomialCdf(x, p[0], p[1], f == "upper");
}

// Family names as the precision files write them ("chisq", "t") or as the
// functions are named ("ChiSq", "T").
double evaluate(std::string family, const std::string& f, double x, Params p) {
  family[0] = static_cast<char>(std::toupper(family[0]));
  if (family == "Chisq") family = "ChiSq";
  if (family == "ChiSq") return chiSq(f, x, p);
  if (family == "F") return fDist(f, x, p);
  if (family == "T") return tDist(f, x, p);
  if (family == "Binomial") return binomial(f, x, p);
  const auto it = exported().find(family);
  if (it == exported().end()) {
    ADD_FAILURE() << "no such family " << family;
    return 0.0;
  }
  if (f == "pdf") return it->second.pdf(x, p);
  if (f == "inv") return it->second.inv(x, p);
  return it->second.cdf(x, p, f == "upper");
}

TEST(ExportedFamilies, MatchHighPrecisionReferenceValues) {
  const auto rows = qeltest::loadReferenceData("exported_families.csv", 2);
  std::set<std::string> functions;
  for (const auto& row : rows) {
    const std::string& family = row.text[0];
    const std::string& f = row.text[1];
    const double x = row.numbers[0];
    const double expected = row.numbers[4];
    const double actual = evaluate(family, f, x, &row.numbers[1]);
    // Through the ELV routes each tail is good to 1e-8; a quantile inherits
    // that over the slope of the distribution function.
    const double tolerance = f == "inv" ? 1e-7 : 1e-8;
    double error = qeltest::relativeError(actual, expected);
    if (f == "inv" && std::fabs(expected) < 1.0) error = std::fabs(actual - expected);
    EXPECT_LE(error, tolerance) << family << " " << f << " at " << x << " (line " << row.line
                                << "): got " << actual << ", expected " << expected;
    functions.insert(family + " " + f);
  }
  EXPECT_GE(functions.size(), 80u);  // every family in all four functions
}

TEST(ExportedFamilies, DoublePrecisionFromBodyToFarTails) {
  auto rows = qeltest::loadReferenceData("distribution_precision.csv", 2);
  for (const char* more :
       {"distribution_precision_nct.csv", "distribution_body.csv", "series_region_quantiles.csv"}) {
    for (auto& row : qeltest::loadReferenceData(more, 2)) rows.push_back(row);
  }
  for (const auto& row : rows) {
    const std::string& family = row.text[0];
    const std::string& f = row.text[1];
    const double x = row.numbers[0], expected = row.numbers[5];
    if (expected != 0.0 && std::fabs(expected) < 1e-280) continue;
    const bool far = f == "inv" ? x < 1e-6 || x > 1.0 - 1e-6 : std::fabs(expected) < 1e-6;
    const double tolerance = far ? 1e-12 : 1e-14;
    const double actual = evaluate(family, f, x, &row.numbers[1]);
    EXPECT_LE(qeltest::relativeError(actual, expected), tolerance)
        << family << " " << f << " line " << row.line << ": " << actual << " vs " << expected;
  }
  EXPECT_GT(rows.size(), 2400u);
}

// Points where the armed state's reading of denormal operands as zero broke
// an answer: arguments, locations and scales near DBL_MIN, and densities
// whose exponential factor alone is a denormal; and hypergeometric laws of
// one point, whose mass formula trapped.
TEST(ExportedFamilies, DenormalIntermediatesKeepTheirValue) {
  const auto rows = qeltest::loadReferenceData("daz_cases.csv", 2);
  for (const auto& row : rows) {
    const double x = row.numbers[0], expected = row.numbers[5];
    // A density here is a far tail of its standardized law lifted by a tiny
    // scale: the rounding of an exponent near 700 costs 700 ulp.
    const bool far = std::fabs(expected) < 1e-6 || row.text[1] == "pdf";
    const double tolerance = far ? 1e-12 : 1e-14;
    const double actual = evaluate(row.text[0], row.text[1], x, &row.numbers[1]);
    EXPECT_LE(qeltest::relativeError(actual, expected), tolerance)
        << row.text[0] << " " << row.text[1] << " line " << row.line << ": " << actual;
  }
  EXPECT_GE(rows.size(), 25u);
}

// Beyond x = 8 the normal tail is the nearest double to the truth, in both
// the scalar and the array forms and from either side of the distribution.
TEST(ExportedFamilies, NormalFarTailIsCorrectlyRounded) {
  const auto rows = qeltest::loadReferenceData("elv_normal_far_tail.csv", 0);
  for (const auto& row : rows) {
    const double x = row.numbers[0], expected = row.numbers[1];
    double array = 0.0;
    qel::NormalCdf(&array, &x, 1, 0.0, 1.0, true);
    EXPECT_EQ(qel::NormalCdf(-x, 0.0, 1.0, false), expected) << x;
    EXPECT_EQ(array, expected) << x;
  }
  EXPECT_GT(rows.size(), 50u);
}

TEST(ExportedFamilies, ArrayFormsRepeatTheScalarForms) {
  const std::vector<double> x = {-2.0, 0.0, 0.3, 1.0, 2.5, 7.0, 1.23456e30};
  const std::vector<double> p = {0.0, 1e-6, 0.25, 0.5, 0.9, 1.0};
  // The parameters of each family's first reference row.
  std::map<std::string, std::vector<double>> parameters;
  for (const auto& row : qeltest::loadReferenceData("exported_families.csv", 2))
    parameters.emplace(row.text[0], std::vector<double>(&row.numbers[1], &row.numbers[4]));
  for (const auto& family : exported()) {
    SCOPED_TRACE(family.first);
    if (parameters.count(family.first) == 0) continue;
    const double* params = parameters.at(family.first).data();
    std::vector<double> out(x.size());
    family.second.pdfArray(out.data(), x.data(), x.size(), params);
    for (std::size_t i = 0; i < x.size(); ++i) {
      const double s = family.second.pdf(x[i], params);
      EXPECT_TRUE(out[i] == s || (std::isnan(out[i]) && std::isnan(s))) << family.first << " pdf";
    }
    for (bool upper : {false, true}) {
      family.second.cdfArray(out.data(), x.data(), x.size(), params, upper);
      for (std::size_t i = 0; i < x.size(); ++i) {
        const double s = family.second.cdf(x[i], params, upper);
        EXPECT_TRUE(out[i] == s || (std::isnan(out[i]) && std::isnan(s))) << family.first << " cdf";
      }
    }
    family.second.invArray(out.data(), p.data(), p.size(), params);
    for (std::size_t i = 0; i < p.size(); ++i) {
      const double s = family.second.inv(p[i], params);
      EXPECT_TRUE(out[i] == s || (std::isnan(out[i]) && std::isnan(s))) << family.first << " inv";
    }
  }
}

TEST(ExportedFamilies, MissingArgumentsComeOutAsNaN) {
  const double missing = 1.23456e30;
  EXPECT_TRUE(std::isnan(qel::NormalCdf(missing, 0.0, 1.0, false)));
  EXPECT_TRUE(std::isnan(qel::ChiSqCdf(missing, 3.0, 0.0, true)));
  EXPECT_TRUE(std::isnan(qel::TCdf(missing, 3.0, 0.0, true)));
  EXPECT_EQ(qel::NormalCdf(0.0, 0.0, 1.0, false), 0.5);
  EXPECT_EQ(qel::NormalCdf(0.0, 0.0, 1.0, true), 0.5);
  EXPECT_TRUE(std::isnan(qel::WeibullInvCdf(1.0, 2.0, 3.0, 0.0)));
}

TEST(ExportedFamilies, LambdaWithNegativeShapeSolvesItsQuantile) {
  // The support is the real line; the distribution function solves Q(p) = x.
  const double at = qel::LambdaInvCdf(0.3, -0.25, 1.0, 2.0);
  EXPECT_NEAR(qel::LambdaCdf(at, -0.25, 1.0, 2.0, false), 0.3, 1e-12);
  // Q(p) = location + scale (p^l - (1-p)^l)/l.
  const double p = 0.3, l = -0.25;
  EXPECT_NEAR(qel::LambdaInvCdf(p, l, 1.0, 2.0),
              1.0 + 2.0 * (std::pow(p, l) - std::pow(1 - p, l)) / l, 1e-13);
}

TEST(ExportedFamilies, DiscreteTableIsBareAndFirstOccurrenceWins) {
  const double values[] = {3.0, 1.0, 2.0, 1.0};
  const double probs[] = {0.5, 0.2, 0.3, 0.9};
  EXPECT_EQ(qel::DiscretePdf(1.0, values, probs, 4), 0.2);
  EXPECT_EQ(qel::DiscretePdf(1.5, values, probs, 4), 0.0);
  EXPECT_DOUBLE_EQ(qel::DiscreteCdf(2.0, values, probs, 4, false), 0.5);
  // The upper tail counts the point: P(X >= 2) = 0.3 + 0.5.
  EXPECT_DOUBLE_EQ(qel::DiscreteCdf(2.0, values, probs, 4, true), 0.8);
  EXPECT_EQ(qel::DiscreteInvCdf(0.45, values, probs, 4), 2.0);
  double x[] = {1.0, 2.0, 3.0};
  qel::DiscreteCdf(x, x, 3UL, values, probs, 4, false);
  EXPECT_DOUBLE_EQ(x[2], 1.0);
}

TEST(PValueFunctions, AlternativesAndOutOfRangeEnumerators) {
  const double lower = qel::NormalCdf(-1.2, 0.0, 1.0, false);
  EXPECT_DOUBLE_EQ(qel::NormalPValue(-1.2, qel::kAlternativeLess), lower);
  EXPECT_DOUBLE_EQ(qel::NormalPValue(-1.2, qel::kAlternativeNotEqual), 2 * lower);
  EXPECT_DOUBLE_EQ(qel::NormalPValue(-1.2, qel::kAlternativeGreater), 1 - lower);
  EXPECT_EQ(qel::NormalPValue(1.0, static_cast<qel::EAlternative>(7)), 0.0);
  EXPECT_EQ(qel::NormalPValue(0.0, qel::kAlternativeNotEqual), 1.0);
  EXPECT_NEAR(qel::NormalCritValue(0.05, qel::kAlternativeNotEqual), 1.959963984540054, 2e-9);
  EXPECT_EQ(qel::NormalCritValue(0.05, qel::kAlternativeLess),
            qel::NormalCritValue(0.05, qel::kAlternativeGreater));
  EXPECT_EQ(qel::FCritValue(0.05, 3.0, 4.0, qel::kAlternativeNotEqual), 0.0);
  EXPECT_EQ(qel::ChiSqCritValue(0.05, 3.0, qel::kAlternativeNotEqual), 0.0);
  // Bonferroni: alpha / k, two-sided at 1 - a/2 = 0.9875.
  EXPECT_EQ(qel::TCritValue(0.05, 10.0, qel::kAlternativeNotEqual, 2),
            qel::TInvCdf(0.9875, 10.0, 0.0));
  EXPECT_NEAR(qel::TCritValue(0.05, 10.0, qel::kAlternativeNotEqual, 1), 2.228138851986274, 1e-9);
  EXPECT_EQ(qel::BinomialPValue(5.0, 10, 0.5, qel::kAlternativeNotEqual), 1.0);
  EXPECT_EQ(qel::BinomialPValue(5.0, 10, 0.5, static_cast<qel::EAlternative>(7)), 0.0);
  // Fisher's exact test at the mode.
  EXPECT_EQ(qel::HypergeometricPValue(4, 40, 15, 10, qel::kAlternativeNotEqual), 1.0);
  EXPECT_NEAR(qel::ChiSqPValue(7.814727903251178, 3.0, qel::kAlternativeGreater), 0.05, 1e-12);
  // With df1 = 2 the upper tail is (1 + 2x/df2)^(-df2/2) = 1.6^-5.
  EXPECT_NEAR(qel::FPValue(3.0, 2.0, 10.0, qel::kAlternativeGreater), 0.095367431640625, 1e-10);
  EXPECT_NEAR(qel::TPValue(2.0, 5.0, qel::kAlternativeNotEqual), 0.101939478829858356, 1e-10);
}

}  // namespace
