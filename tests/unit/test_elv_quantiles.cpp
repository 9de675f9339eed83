// Quantiles of the ELV routines against mpmath (tools/reference/gen_elv_*.py),
// every call in the armed floating-point state. A continuous quantile is held
// to its error in probability (the error of the point times the slope of the
// law there, stored with the reference): 1e-9, or 1e-3 where the
// Cornish-Fisher start stands alone (beta branches 71 and 72). A discrete one
// must hit k exactly and place p within the mass at k to 1e-9 of p.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <cmath>
#include <set>
#include <string>

#include "elv_calls.h"
#include "reference_data.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

constexpr double kTolerance = 1e-9;

std::string at(const qeltest::Row& row, const char* file) {
  return std::string(file) + ":" + std::to_string(row.line);
}

int run(const std::string& call, double a0, double a1, double a2, double a3, double* o,
        const std::string& where) {
  const double a[4] = {a0, a1, a2, a3};
  return qeltest::runArmed(qeltest::elvCalls().at(call), a, o, where);
}

// A discrete quantile: status 0, k exact, and the fraction's error times the
// mass at k over p (weight) within the tolerance.
void checkDiscrete(int status, const double* o, double k, double f, double weight,
                   const std::string& where, double tol = kTolerance) {
  EXPECT_EQ(status, 0) << where;
  EXPECT_EQ(o[0], k) << where;
  EXPECT_GE(o[1], 0.0) << where;
  EXPECT_LT(o[1], 1.0) << where;
  EXPECT_LE(std::fabs(o[1] - f) * weight, tol) << where << ": fraction " << o[1] << " vs " << f;
}

TEST(ElvQuantiles, NormalAllThreeForms) {
  double o[3];
  for (const auto& row : loadReferenceData("elv_normal_quantiles.csv", 0)) {
    const double p = row.numbers[0], z = row.numbers[1];
    const std::string where = at(row, "elv_normal_quantiles.csv");
    // Absolute error near the centre, where z passes through 0.
    const double tol = 1e-9 * std::max(1.0, std::fabs(z));
    ASSERT_LE(run("normal_upper_quant", p, 0, 0, 0, o, where), 1);
    EXPECT_NEAR(o[0], z, tol) << where;
    ASSERT_LE(run("normal_lower_quant", p, 0, 0, 0, o, where), 1);
    EXPECT_NEAR(o[0], -z, tol) << where;
    ASSERT_LE(run("inv_normal_df", p, 0, 0, 0, o, where), 1);
    EXPECT_NEAR(o[0], -z, tol) << where;
    if (p > 1e-16) {
      // 1 - p is rounded; the quantile of the rounded complement is z only
      // to the accuracy of that rounding, relative to the density.
      ASSERT_LE(run("inv_normal_df", 1.0 - p, 0, 0, 0, o, where), 1);
      EXPECT_NEAR(o[0], z, 1e-9 * std::max(1.0, z) + 1e-16 / (p * std::max(z, 1.0))) << where;
    }
  }
}

TEST(ElvQuantiles, GammaAndChiSquare) {
  double o[3];
  int rows = 0;
  for (const auto& row : loadReferenceData("elv_quantiles.csv", 1)) {
    const std::string& kind = row.text[0];
    if (kind != "gamma_lower" && kind != "gamma_upper") continue;
    ++rows;
    const std::string where = at(row, "elv_quantiles.csv");
    const double p = row.numbers[0], a = row.numbers[1], q = row.numbers[2];
    const double sensitivity = row.numbers[3];
    const std::string form = kind == "gamma_upper" ? "upper" : "lower";
    // The chi-square quantile is twice the gamma one at twice the shape.
    for (int chi2 = 0; chi2 < 2; ++chi2) {
      const double scale = chi2 ? 2.0 : 1.0;
      const int status =
          run((chi2 ? "chi2_" : "gamma_") + form + "_quant", p, scale * a, 0, 0, o, where);
      if (status == 1) {
        EXPECT_EQ(o[0], 0.0) << where;
        EXPECT_LT(q, 1e-280) << where;
        continue;
      }
      ASSERT_EQ(status, 0) << where;
      // Beyond a shape of 10000 Cornish-Fisher stands without Newton steps.
      EXPECT_LE(relativeError(o[0], scale * q) * sensitivity, a > 10000.0 ? 1e-8 : kTolerance)
          << where << ": " << o[0] << " vs " << q;
    }
  }
  EXPECT_GT(rows, 200);
}

TEST(ElvQuantiles, BetaReachesEveryRegion) {
  double o[3];
  std::set<long long> methods;
  for (const auto& row : loadReferenceData("elv_beta_quant.csv", 1)) {
    const std::string where = at(row, "elv_beta_quant.csv");
    const double p = row.numbers[0], x = row.numbers[3], slope = row.numbers[5];
    const int status =
        run("beta_" + row.text[0] + "_quant", p, row.numbers[1], row.numbers[2], 0, o, where);
    const double q = o[0];
    methods.insert(ELVmethod);
    if (status == 1) {
      // A quantile within the smallest argument of 0 or of 1.
      EXPECT_TRUE(q == 0.0 || q == 1.0) << where;
      EXPECT_LT(std::fabs(q - x), 1e-280) << where;
      continue;
    }
    ASSERT_EQ(status, 0) << where << " method " << ELVmethod;
    // Error in probability beyond the spacing of doubles at q (a quantile
    // within 1e-300 of 1 can only be 1).
    const double beyond = std::fabs(q - x) - std::fabs(std::nextafter(q, 2.0) - q);
    const double e = beyond > 0.0 ? beyond * slope : 0.0;
    const bool approximate = ELVmethod == 71 || ELVmethod == 72;
    EXPECT_LE(e, approximate ? 1e-3 : kTolerance)
        << where << " method " << ELVmethod << ": " << q << " vs " << x;
  }
  for (long long m :
       {11, 12, 20, 31, 32, 33, 41, 42, 43, 44, 51, 52, 61, 62, 71, 72, 81, 82, 83, 91, 92, 93}) {
    EXPECT_TRUE(methods.count(m)) << "region " << m << " not reached";
  }
}

TEST(ElvQuantiles, F) {
  double o[3];
  for (const auto& row : loadReferenceData("elv_F_quant.csv", 1)) {
    const std::string where = at(row, "elv_F_quant.csv");
    const double reference = row.numbers[3];
    const int status = run("F_" + row.text[0] + "_quant", row.numbers[0], row.numbers[1],
                           row.numbers[2], 0, o, where);
    if (!(reference > 1e-300 && reference < 1e300)) {
      // Beyond the doubles: the beta quantile is 0 or 1 to working precision.
      EXPECT_TRUE(status == 1 || status == 4) << where << ": " << o[0];
      continue;
    }
    ASSERT_EQ(status, 0) << where;
    const double e = std::fabs(o[0] - reference) * row.numbers[4];
    const bool approximate = ELVmethod == 71 || ELVmethod == 72;
    EXPECT_LE(e, approximate ? 1e-3 : kTolerance) << where << ": " << o[0] << " vs " << reference;
  }
}

TEST(ElvQuantiles, PoissonBinomialAndHypergeometric) {
  double o[3];
  int rows[3] = {0, 0, 0};
  for (const auto& row : loadReferenceData("elv_quantiles.csv", 1)) {
    const std::string& kind = row.text[0];
    if (kind != "poisson_lower" && kind != "poisson_upper") continue;
    const std::string where = at(row, "elv_quantiles.csv");
    const auto& v = row.numbers;  // p, m, k, mass/p, f
    const int status = run(kind + "_quant", v[0], v[1], 0, 0, o, where);
    checkDiscrete(status, o, v[2], v[4], v[3], where);
    ++rows[0];
  }
  for (const auto& row : loadReferenceData("elv_binomial_quant.csv", 1)) {
    const auto& v = row.numbers;  // p, n, prob, k, f, mass
    if (v[2] == 0.0 || v[2] == 1.0) continue;
    const std::string where = at(row, "elv_binomial_quant.csv");
    const int status = run("binomial_" + row.text[0] + "_quant", v[1], v[0], v[2], 0, o, where);
    checkDiscrete(status, o, v[3], v[4], v[5] / v[0], where);
    ++rows[1];
  }
  for (const auto& row : loadReferenceData("elv_hypergeo_quantiles.csv", 0)) {
    const auto& v = row.numbers;  // p, N, M, n, lower k and f, upper k and f
    const std::string where = at(row, "elv_hypergeo_quantiles.csv");
    for (int upper = 0; upper < 2; ++upper) {
      const int status = run(upper ? "hypergeo_upper_quant" : "hypergeo_lower_quant", v[0], v[1],
                             v[2], v[3], o, where);
      double m[3];
      run("hypergeo_df", o[0], v[1], v[2], v[3], m, where);
      // f is p minus a tail over the mass at k: the tails' 1e-8 over p.
      checkDiscrete(status, o, v[4 + 2 * upper], v[5 + 2 * upper], m[2] / v[0], where, 1e-8);
    }
    ++rows[2];
  }
  EXPECT_GT(rows[0], 100);
  EXPECT_GT(rows[1], 50);
  EXPECT_GT(rows[2], 20);
}

}  // namespace
