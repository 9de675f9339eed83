// ELV hypergeometric routines against mpmath sums
// (tools/reference/gen_elv_normal_hyper.py): tails and mass for populations
// up to 9.49e7, the randomised quantiles, and the symmetry and trivial paths.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <string>
#include <vector>

#include "reference_data.h"
#include "utilities/elv/wrappers.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

unsigned long count(double x) {
  return static_cast<unsigned long>(x);
}

TEST(ElvHypergeometric, TailsAndMassMatchReference) {
  double worst = 0.0;
  for (const auto& row : loadReferenceData("elv_hypergeo.csv", 0)) {
    const auto& v = row.numbers;
    double lower = -1.0, upper = -1.0, mass = -1.0;
    const qel::ElvStatus status = qel::elv_hypergeo_df(count(v[0]), count(v[1]), count(v[2]),
                                                       count(v[3]), &lower, &upper, &mass);
    const std::string where = "line " + std::to_string(row.line);
    ASSERT_FALSE(qel::ElvFailed(status)) << where;
    for (int i = 0; i < 3; ++i) {
      const double got = i == 0 ? lower : i == 1 ? upper : mass;
      if (v[4 + i] < 1e-300) {
        // Beyond the underflow limit the value is 0, flagged by status 1
        // where a tail was set to 0.
        EXPECT_EQ(got, 0.0) << where << " output " << i;
        if (i < 2 && v[4 + i] > 0.0) {
          EXPECT_EQ(status, qel::ElvLossOfSignificance) << where;
        }
        continue;
      }
      const double e = relativeError(got, v[4 + i]);
      EXPECT_LT(e, 1e-8) << where << " output " << i << " got " << got << " want " << v[4 + i];
      worst = std::max(worst, e);
    }
  }
  std::printf("hypergeo_df largest relative error %.3g\n", worst);
}

double massAt(unsigned long k, const std::vector<double>& v) {
  double lower, upper, mass;
  qel::elv_hypergeo_df(k, count(v[1]), count(v[2]), count(v[3]), &lower, &upper, &mass);
  return mass;
}

TEST(ElvHypergeometric, QuantilesMatchReference) {
  double worstF = 0.0;
  for (const auto& row : loadReferenceData("elv_hypergeo_quantiles.csv", 0)) {
    const auto& v = row.numbers;
    const std::string where = "line " + std::to_string(row.line);
    unsigned long k = 0;
    double f = -1.0;
    ASSERT_EQ(qel::elv_hypergeo_lower_quant(v[0], count(v[1]), count(v[2]), count(v[3]), &k, &f),
              qel::ElvNoError)
        << where;
    EXPECT_EQ(k, count(v[4])) << where;
    // f is p minus a tail, over the mass at k: its error is that of the
    // tail (relative 1e-8) over the mass.
    EXPECT_NEAR(f, v[5], 1e-8 * v[0] / massAt(k, v)) << where;
    worstF = std::max(worstF, std::fabs(f - v[5]) * massAt(k, v) / v[0]);
    ASSERT_EQ(qel::elv_hypergeo_upper_quant(v[0], count(v[1]), count(v[2]), count(v[3]), &k, &f),
              qel::ElvNoError)
        << where;
    EXPECT_EQ(k, count(v[6])) << where;
    EXPECT_NEAR(f, v[7], 1e-8 * v[0] / massAt(k, v)) << where;
    worstF = std::max(worstF, std::fabs(f - v[7]) * massAt(k, v) / v[0]);
  }
  std::printf("hypergeometric quantile largest error of f P(X=k), relative to p: %.3g\n", worstF);
}

TEST(ElvHypergeometric, TrivialAndInvalidCases) {
  double lower, upper, mass;
  EXPECT_EQ(qel::elv_hypergeo_df(0, 1, 0, 0, &lower, &upper, &mass), qel::ElvArgumentOutOfRange);
  EXPECT_EQ(qel::elv_hypergeo_df(3, 10, 2, 4, &lower, &upper, &mass), qel::ElvArgumentOutOfRange);
  EXPECT_EQ(qel::elv_hypergeo_df(0, 10, 2, 9, &lower, &upper, &mass), qel::ElvArgumentOutOfRange);
  EXPECT_EQ(qel::elv_hypergeo_df(0, 94906266, 2, 9, &lower, &upper, &mass),
            qel::ElvArgumentOutOfRange);
  // n = 0: all the mass at 0.
  EXPECT_EQ(qel::elv_hypergeo_df(0, 12345, 17, 0, &lower, &upper, &mass), qel::ElvNoError);
  EXPECT_EQ(mass, 1.0);
  EXPECT_EQ(lower, 1.0);
  EXPECT_EQ(upper, 0.0);
  EXPECT_EQ(ELVmethod, 1);
  qel::elv_hypergeo_df(7, 20, 7, 20, &lower, &upper, &mass);
  EXPECT_EQ(ELVmethod, 2);
  EXPECT_EQ(mass, 1.0);
  qel::elv_hypergeo_df(0, 20, 0, 5, &lower, &upper, &mass);
  EXPECT_EQ(ELVmethod, 3);
  qel::elv_hypergeo_df(5, 20, 20, 5, &lower, &upper, &mass);
  EXPECT_EQ(ELVmethod, 4);
  EXPECT_EQ(ELVsteps1, 0);
  // k = n = M below N: the top of the support, method 100 + 6.
  EXPECT_EQ(qel::elv_hypergeo_df(4, 10, 4, 4, &lower, &upper, &mass), qel::ElvNoError);
  EXPECT_EQ(ELVmethod, 106);
  EXPECT_EQ(lower, 1.0);
  EXPECT_EQ(upper, 0.0);
  EXPECT_NEAR(mass, 1.0 / 210.0, 1e-15);
  // s = t = 0.5 exactly: the direct branch.
  qel::elv_hypergeo_df(2, 20, 10, 10, &lower, &upper, &mass);
  EXPECT_GE(ELVmethod, 100);
  EXPECT_LT(ELVmethod, 200);
}

TEST(ElvHypergeometric, SymmetryBranchesAgree) {
  // X, n - X, M - X and N - M - n + X describe one table; the four branches
  // must give the same three numbers for the mirrored arguments.
  struct Case {
    unsigned long k, N, M, n;
    int method;
  };
  const Case cases[] = {
      {3, 50, 10, 12, 100}, {9, 50, 40, 12, 200}, {7, 50, 10, 38, 300}, {31, 50, 38, 40, 400}};
  double ref[3] = {0, 0, 0};
  for (const Case& c : cases) {
    double lower, upper, mass;
    ASSERT_EQ(qel::elv_hypergeo_df(c.k, c.N, c.M, c.n, &lower, &upper, &mass), qel::ElvNoError);
    EXPECT_EQ(ELVmethod / 100 * 100, c.method);
    if (c.method == 100) {
      ref[0] = lower, ref[1] = upper, ref[2] = mass;
      continue;
    }
    // Cases 2 and 3 count the complement: their lower tail is P(X >= k).
    const bool mirrored = c.method != 400;
    const double lowerWant = mirrored ? ref[1] + ref[2] : ref[0];
    EXPECT_NEAR(lower, lowerWant, 1e-13) << c.method;
    EXPECT_NEAR(mass, ref[2], 1e-13) << c.method;
  }
}

TEST(ElvHypergeometric, QuantileRangeAndTinyTail) {
  unsigned long k = 0;
  double f = 0.0;
  EXPECT_EQ(qel::elv_hypergeo_lower_quant(0.1, 20, 20, 5, &k, &f), qel::ElvArgumentOutOfRange);
  EXPECT_EQ(k, 94906265UL);
  EXPECT_EQ(qel::elv_hypergeo_upper_quant(0.6, 20, 5, 5, &k, &f), qel::ElvArgumentOutOfRange);
  EXPECT_EQ(qel::elv_hypergeo_upper_quant(1e-13, 20, 5, 5, &k, &f), qel::ElvArgumentOutOfRange);
  EXPECT_EQ(qel::elv_hypergeo_lower_quant(0.1, 1, 0, 0, &k, &f), qel::ElvArgumentOutOfRange);
  // A tail set to 0 with status 1 is no failure: P(X > 1900) here is far
  // below the smallest double.
  double lower, upper, mass;
  EXPECT_EQ(qel::elv_hypergeo_df(1900, 90000000, 45000000, 2000, &lower, &upper, &mass),
            qel::ElvLossOfSignificance);
  EXPECT_EQ(upper, 0.0);
  EXPECT_EQ(lower, 1.0);
}

}  // namespace
