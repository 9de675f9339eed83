// Error frame of the beta, binomial and F routines: range checks and their
// failure outputs, special cases, method numbers and step counters on
// representative branches, the reflections that must stop, and the wrappers.
#include <gtest/gtest.h>
#include <qel/distributions.h>
#include <qel/elv.h>

#include <array>
#include <cmath>
#include <limits>
#include <stdexcept>
#include <string>

#include "utilities/elv/wrappers.h"

namespace {

constexpr double kHuge = 1.7976931348623157e308;
const double kNaN = std::numeric_limits<double>::quiet_NaN();

std::string routine() {
  return std::string(ELVroutine);
}

TEST(ElvBetaFrame, BetaDfRangeChecksAndSpecialCases) {
  double lower = 7, upper = 7, density = 7;
  for (const auto& args : {std::array<double, 3>{-0.1, 2, 3},
                           {1.1, 2, 3},
                           {0.5, -1, 3},
                           {0.5, 2, 94906266.0},
                           {kNaN, 2, 3},
                           {0.5, 2, kNaN}}) {
    beta_df(args[0], args[1], args[2], &lower, &upper, &density);
    EXPECT_EQ(ELVerrno, 2);
    EXPECT_EQ(routine(), "beta_df");
  }
  EXPECT_EQ(lower, 7.0);  // outputs untouched on code 2

  beta_df(0.0, 2, 3, &lower, &upper, &density);
  EXPECT_EQ(ELVerrno, 0);
  EXPECT_EQ(lower, 0.0);
  EXPECT_EQ(upper, 1.0);
  EXPECT_EQ(density, -1.0);
  beta_df(1.0, 2, 3, &lower, &upper, &density);
  EXPECT_EQ(lower, 1.0);
  EXPECT_EQ(upper, 0.0);
  EXPECT_EQ(density, -1.0);

  // Vanishing shapes: two point masses, whatever x.
  for (double x : {1e-100, 0.2, 0.9}) {
    beta_df(x, 1e-13, 3e-13, &lower, &upper, &density);
    EXPECT_EQ(ELVerrno, 1);
    EXPECT_DOUBLE_EQ(lower, 0.75);
    EXPECT_DOUBLE_EQ(upper, 0.25);
  }
  beta_df(0.3, 1e-13, 1e-13, &lower, &upper, &density);
  EXPECT_EQ(ELVerrno, 1);
  EXPECT_DOUBLE_EQ(lower, 0.5);
}

TEST(ElvBetaFrame, BetaDfMethodsOnEachBranch) {
  double lower, upper, density;
  // x = 1/2 is not exchanged: with (2, 5) it lies above the border (upper
  // tail, finite series, 60); exchanged it would give the lower tail (10).
  beta_df(0.5, 2.0, 5.0, &lower, &upper, &density);
  EXPECT_EQ(ELVmethod, 60);
  beta_df(std::nextafter(0.5, 1.0), 5.0, 2.0, &lower, &upper, &density);
  EXPECT_EQ(ELVmethod, 60);  // exchanged to (2, 5) at just below 1/2
  beta_df(0.5, 5.0, 2.0, &lower, &upper, &density);
  EXPECT_EQ(ELVmethod, 10);
  // Lower tail: the finite form ends at b = 3 after 3 terms.
  beta_df(0.1, 2.0, 3.0, &lower, &upper, &density);
  EXPECT_EQ(ELVmethod, 10);
  EXPECT_EQ(ELVsteps1, 3);
  // Small a, b x below 1: the power series (50); above 1 the continued
  // fraction (60 + 1) after the finite part of a = 2.5.
  beta_df(0.02, 0.5, 20.0, &lower, &upper, &density);
  EXPECT_EQ(ELVmethod, 50);
  beta_df(0.2, 0.5, 20.0, &lower, &upper, &density);
  EXPECT_EQ(ELVmethod, 61);
  EXPECT_GT(ELVsteps2, 0);
  beta_df(0.3, 2.5, 20.0, &lower, &upper, &density);
  EXPECT_EQ(ELVmethod, 61);
  // Far tails: 0 with code 1.
  beta_df(1e-200, 5.0, 5.0, &lower, &upper, &density);
  EXPECT_EQ(ELVerrno, 1);
  EXPECT_EQ(lower, 0.0);
  EXPECT_EQ(upper, 1.0);
  beta_df(1.0 - 1e-12, 5.0, 400.0, &lower, &upper, &density);
  EXPECT_EQ(ELVerrno, 1);
  EXPECT_EQ(upper, 0.0);
  EXPECT_EQ(lower, 1.0);
}

TEST(ElvBetaFrame, ScaledSeriesCountTheirTerms) {
  double out;
  EXPECT_EQ(beta_Iabx(&out, 2.0, 4.0, 0.2), 0);
  EXPECT_EQ(ELVsteps1, 4);  // finite form, terms 1..4, the 4th is 0
  ELVsteps2 = 0;
  EXPECT_EQ(beta_Iabx(&out, 2.0, 4.5, 0.45), 0);
  EXPECT_GT(ELVsteps2, 0);  // alternating tail too slow: hypergeometric form
  EXPECT_EQ(beta_Jabx(&out, 3.0, 2.0, 0.7), 0);
  EXPECT_EQ(ELVsteps1, 3);
  EXPECT_EQ(ELVmethod, 0);
  EXPECT_EQ(beta_J_complete(&out, 0.5, 0.5, 0.2), 0);
  EXPECT_EQ(ELVmethod, 2);
  EXPECT_EQ(ELVsteps2, 12);
  EXPECT_EQ(beta_J_complete(&out, 0.5, 10.0, 0.3), 0);
  EXPECT_EQ(ELVmethod, 1);
}

TEST(ElvBetaFrame, LogOfTheGammaRatioAgreesAcrossItsForms) {
  // ln(b^a Gamma(b)/Gamma(a+b)) has four forms; where two meet they must
  // agree to the accuracy of their truncations.
  EXPECT_NEAR(beta_lntab(1e-5, 50.0 - 1e-9), beta_lntab(1e-5, 50.0), 1e-12);
  EXPECT_NEAR(beta_lntab(0.5, 50.0 - 1e-9), beta_lntab(0.5, 50.0), 1e-10);
  EXPECT_NEAR(beta_lntab(1e-5 * (1 - 1e-9), 3.0), beta_lntab(1e-5, 3.0), 1e-13);
  EXPECT_NEAR(beta_lntab(1e-6, 0.006 * (1 - 1e-12)), beta_lntab(1e-6, 0.006), 1e-8);
}

TEST(ElvBetaFrame, NoncentralReflectionStopsAfterOneHop) {
  double l1, u1, l2, u2;
  beta_ncdf(0.5, 2.0, 3.0, 4.0, &l1, &u1);
  EXPECT_EQ(routine(), "beta_ncdf");
  EXPECT_LT(ELVmethod, 1000);
  beta_ncdf2(0.5, 3.0, 2.0, 4.0, &l2, &u2);
  EXPECT_EQ(ELVerrno, 0);
  EXPECT_EQ(routine(), "beta_ncdf");  // one hop, to beta_ncdf, and no further
  EXPECT_LT(ELVmethod, 1000);
  EXPECT_EQ(l2, u1);
  EXPECT_EQ(u2, l1);
  // Above 1/2 beta_ncdf runs as beta_ncdf2.
  beta_ncdf(0.8, 2.0, 3.0, 4.0, &l1, &u1);
  EXPECT_EQ(routine(), "beta_ncdf2");
  EXPECT_GE(ELVmethod, 1000);
  EXPECT_NEAR(l1 + u1, 1.0, 1e-15);
}

TEST(ElvBetaFrame, NoncentralChecksAndStartingCases) {
  double lower = 7, upper = 7;
  beta_ncdf(0.3, 2.0, 3.0, -1.0, &lower, &upper);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(routine(), "beta_ncdf");
  beta_ncdf2(1.3, 2.0, 3.0, 1.0, &lower, &upper);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(routine(), "beta_ncdf2");
  beta_ncdf(0.3, 94906000.0, 3.0, 1000.0, &lower, &upper);
  EXPECT_EQ(ELVerrno, 3);
  EXPECT_EQ(lower, 7.0);
  beta_ncdf(0.0, 2.0, 3.0, 5.0, &lower, &upper);
  EXPECT_EQ(ELVerrno, 0);
  EXPECT_EQ(lower, 0.0);
  EXPECT_EQ(upper, 1.0);
  beta_ncdf2(0.0, 2.0, 3.0, 5.0, &lower, &upper);
  EXPECT_EQ(ELVmethod, 1000);
  // L = 0 is the central law.
  double l2, u2, density;
  beta_ncdf(0.3, 2.0, 3.0, 0.0, &lower, &upper);
  beta_df(0.3, 2.0, 3.0, &l2, &u2, &density);
  EXPECT_EQ(lower, l2);
  EXPECT_EQ(upper, u2);
  // Counters: start, peak and last index of the descending sum.
  beta_ncdf(0.2, 2.0, 8.0, 50.0, &lower, &upper);
  EXPECT_EQ(ELVmethod, 13);
  EXPECT_GT(ELVsteps1, 50);
  EXPECT_LE(ELVsteps2, ELVsteps1);
  EXPECT_LE(ELVsteps3, ELVsteps2);
  // Far below the mixture: the peak term underflows.
  beta_ncdf(1e-100, 20.0, 8.0, 50.0, &lower, &upper);
  EXPECT_EQ(ELVerrno, 1);
  EXPECT_EQ(ELVmethod, 12);
  EXPECT_EQ(lower, 0.0);
}

TEST(ElvBetaFrame, BinomialSpecialCasesAndMethods) {
  double lower = 7, upper = 7, mass = 7;
  binomial_df(11, 10, 0.3, &lower, &upper, &mass);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(ELVmethod, 100);
  binomial_df(3, 94906266, 0.3, &lower, &upper, &mass);
  EXPECT_EQ(ELVerrno, 2);
  binomial_df(3, 10, 1.5, &lower, &upper, &mass);
  EXPECT_EQ(ELVerrno, 2);

  binomial_df(0, 0, 0.3, &lower, &upper, &mass);
  EXPECT_EQ(ELVmethod, 1);
  EXPECT_EQ(mass, 1.0);
  binomial_df(2, 10, 0.0, &lower, &upper, &mass);
  EXPECT_EQ(ELVmethod, 2);
  EXPECT_EQ(lower, 1.0);
  EXPECT_EQ(mass, 0.0);
  binomial_df(9, 10, 1.0, &lower, &upper, &mass);
  EXPECT_EQ(ELVmethod, 3);
  EXPECT_EQ(lower, 0.0);
  EXPECT_EQ(upper, 1.0);
  for (double prob : {0.2, 0.9}) {
    binomial_df(10, 10, prob, &lower, &upper, &mass);
    EXPECT_EQ(ELVmethod, 4);
    EXPECT_EQ(lower, 1.0);
    EXPECT_EQ(upper, 0.0);
    EXPECT_NEAR(mass, std::pow(prob, 10), 1e-14 * std::pow(prob, 10));
  }
  binomial_df(1, 10, 0.3, &lower, &upper, &mass);  // below the mode
  EXPECT_EQ(ELVmethod, 110);
  binomial_df(5, 10, 0.3, &lower, &upper, &mass);
  EXPECT_EQ(ELVmethod, 120);
  binomial_df(5, 10, 0.7, &lower, &upper, &mass);  // failures: 4 of 10 at 0.3
  EXPECT_EQ(ELVmethod, 220);
  binomial_df(8, 10, 0.7, &lower, &upper, &mass);  // failures: 1 of 10 at 0.3
  EXPECT_EQ(ELVmethod, 210);
  binomial_df(2, 100, 0.5, &lower, &upper, &mass);
  EXPECT_EQ(ELVmethod, 110);
  binomial_df(2, 1000, 0.5, &lower, &upper, &mass);  // mass below the limit
  EXPECT_EQ(ELVerrno, 1);
  EXPECT_EQ(ELVmethod, 111);
  binomial_df(0, 90000000, 0.5, &lower, &upper, &mass);  // mass underflows
  EXPECT_EQ(ELVerrno, 1);
  EXPECT_EQ(lower, 0.0);
  EXPECT_EQ(upper, 1.0);
}

TEST(ElvBetaFrame, BinomialQuantileFrame) {
  long k = 0;
  double f = 0;
  binomial_lower_quant(10, 0.7, 0.3, &k, &f);  // p above 1/2
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(k, 94906265);
  binomial_upper_quant(0, 0.1, 0.3, &k, &f);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(routine(), "binomial_upper_quant");
  binomial_upper_quant(10, 0.1, 0.0, &k, &f);
  EXPECT_EQ(k, 0);
  EXPECT_EQ(f, 0.1);
  EXPECT_EQ(ELVmethod, 1);
  binomial_lower_quant(10, 0.1, 1.0, &k, &f);
  EXPECT_EQ(k, 10);
  EXPECT_EQ(ELVmethod, 2);
  // The two forms mirror each other under prob -> 1 - prob.
  long k2 = 0;
  double f2 = 0;
  binomial_upper_quant(200, 0.05, 0.3, &k, &f);
  EXPECT_EQ(ELVmethod, 4);
  binomial_lower_quant(200, 0.05, 0.7, &k2, &f2);
  EXPECT_EQ(ELVmethod, 4);
  EXPECT_EQ(k2, 200 - k);
  EXPECT_NEAR(f2, f, 1e-12);
}

TEST(ElvBetaFrame, QuantileRangeChecks) {
  double q = 0;
  beta_lower_quant(0.6, 2, 3, &q);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(q, -kHuge);
  beta_upper_quant(1e-13, 2, 3, &q);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(routine(), "beta_upper_quant");
  beta_lower_quant(0.1, 0.0009, 3, &q);
  EXPECT_EQ(ELVerrno, 2);
  beta_lower_quant(0.1, 2, 94906265.0, &q);
  EXPECT_EQ(ELVerrno, 2);
  F_upper_quant(0.1, 0.001, 3, &q);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(q, -kHuge);
  EXPECT_EQ(routine(), "F_upper_qt");
  F_lower_quant(0.1, 3, 2e8, &q);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(routine(), "F_upper_qt");
  F_lower_quant(0.1, 3, 7, &q);
  EXPECT_EQ(ELVerrno, 0);
  EXPECT_EQ(routine(), "F_upper_qt");
  EXPECT_GT(q, 0.0);
}

TEST(ElvBetaFrame, FRangeChecksAndTheOtherForm) {
  double lower = 7, upper = 7;
  F_df(-1.0, 3, 4, &lower, &upper);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(routine(), "F_df");
  F_ncdf(1.0, 3, 2e8, 1.0, &lower, &upper);
  EXPECT_EQ(ELVerrno, 2);
  F_ncdf(1.0, 3, 4, -1.0, &lower, &upper);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(lower, 7.0);
  // Degenerate degrees of freedom do not trap.
  F_df(2.0, 0.0, 4.0, &lower, &upper);
  EXPECT_LT(ELVerrno, 2);
  F_df(0.0, 0.0, 0.0, &lower, &upper);
  EXPECT_LT(ELVerrno, 2);
}

TEST(ElvBetaFrame, WrappersForwardOutputsAndStatus) {
  double lower, upper, density, q;
  EXPECT_EQ(qel::elv_beta_df(0.3, 2, 3, &lower, &upper, &density), qel::ElvNoError);
  double l2, u2, d2;
  beta_df(0.3, 2, 3, &l2, &u2, &d2);
  EXPECT_EQ(lower, l2);
  EXPECT_EQ(density, d2);
  EXPECT_EQ(qel::elv_beta_df(1e-200, 5, 5, &lower, &upper, &density), qel::ElvLossOfSignificance);
  EXPECT_FALSE(qel::ElvFailed(qel::elv_beta_df(1e-200, 5, 5, &lower, &upper, &density)));
  EXPECT_TRUE(qel::ElvFailed(qel::elv_beta_lower_quant(0.7, 2, 3, &q)));
  EXPECT_EQ(qel::elv_beta_upper_quant(0.2, 2, 3, &q), qel::ElvNoError);
  double q2;
  EXPECT_EQ(qel::elv_beta_lower_quant(0.2, 3, 2, &q2), qel::ElvNoError);
  EXPECT_NEAR(q, 1.0 - q2, 1e-12);
  EXPECT_EQ(qel::elv_F_df(2.0, 3, 4, &lower, &upper), qel::ElvNoError);
  EXPECT_EQ(qel::elv_F_ncdf(2.0, 3, 4, 0.0, &l2, &u2), qel::ElvNoError);
  EXPECT_EQ(lower, l2);
  EXPECT_EQ(qel::elv_F_ncdf(2.0, 3, 4, -1.0, &l2, &u2), qel::ElvArgumentOutOfRange);
  EXPECT_EQ(qel::elv_beta_ncdf(0.3, 2, 3, 1.0, &lower, &upper), qel::ElvNoError);
  EXPECT_EQ(qel::elv_F_upper_quant(0.05, 3, 4, &q), qel::ElvNoError);
  EXPECT_EQ(qel::elv_F_lower_quant(0.05, 3, 4, &q2), qel::ElvNoError);
  EXPECT_LT(q2, q);
  double mass;
  EXPECT_EQ(qel::elv_binomial_df(3ul, 10ul, 0.3, &lower, &upper, &mass), qel::ElvNoError);
  EXPECT_EQ(qel::elv_binomial_df(11ul, 10ul, 0.3, &lower, &upper, &mass),
            qel::ElvArgumentOutOfRange);
  unsigned long k;
  double f;
  EXPECT_EQ(qel::elv_binomial_lower_quant(0.2, 10ul, 0.3, &k, &f), qel::ElvNoError);
  EXPECT_EQ(qel::elv_binomial_upper_quant(0.2, 10ul, 0.3, &k, &f), qel::ElvNoError);
  EXPECT_EQ(qel::elv_binomial_upper_quant(0.2, 0ul, 0.3, &k, &f), qel::ElvArgumentOutOfRange);
}

}  // namespace

namespace {

// Every routine over a grid that includes the edges of the admissible
// ranges, in the armed state: no trap may escape (a trap inside a library
// function would end the process), and the status is always one of 0 to 4.
TEST(ElvBetaFrame, ArmedSweepOverExtremeArguments) {
  const double shapes[] = {0.0, 1e-300, 1e-13, 1e-3, 0.3, 1.0, 2.5, 50.0, 3e4, 9e7, 94906265.0};
  const double xs[] = {0.0, 1e-300, 1e-200, 1e-20, 1e-5, 0.1, 0.5, 0.9, 1.0 - 1e-12, 1.0};
  const double Ls[] = {0.0, 1e-300, 0.01, 3.0, 500.0, 1e4};
  const double ps[] = {1e-12, 1e-6, 0.1, 0.5};
  int runs = 0;
  qel::SetLynFpuStates();
  try {
    for (double a : shapes) {
      for (double b : shapes) {
        for (double x : xs) {
          double lower, upper, density;
          beta_df(x, a, b, &lower, &upper, &density);
          ASSERT_LE(ELVerrno, 4);
          F_df(x * 1e3, 2 * a, 2 * b, &lower, &upper);
          ++runs;
          if (a > 1e4 && b > 1e4) continue;  // keep the mixtures short
          for (double L : Ls) {
            beta_ncdf(x, a, b, L, &lower, &upper);
            ASSERT_LE(ELVerrno, 4);
            beta_ncdf2(x, a, b, L, &lower, &upper);
            ASSERT_LE(ELVerrno, 4);
          }
        }
        for (double p : ps) {
          double q;
          beta_lower_quant(p, a, b, &q);
          ASSERT_LE(ELVerrno, 4);
          beta_upper_quant(p, a, b, &q);
          F_upper_quant(p, 2 * a, 2 * b, &q);
          F_lower_quant(p, 2 * a, 2 * b, &q);
          ASSERT_LE(ELVerrno, 4);
        }
      }
    }
    for (long n : {1L, 2L, 40L, 100000L, 94906265L}) {
      for (double prob : {0.0, 1e-300, 1e-9, 0.3, 0.5, 0.7, 1.0 - 1e-12, 1.0}) {
        for (long k : {0L, 1L, n / 3, n / 2, n - 1, n}) {
          double lower, upper, mass;
          binomial_df(k, n, prob, &lower, &upper, &mass);
          ASSERT_LE(ELVerrno, 4);
        }
        for (double p : ps) {
          long k;
          double f;
          binomial_lower_quant(n, p, prob, &k, &f);
          ASSERT_LE(ELVerrno, 4);
          binomial_upper_quant(n, p, prob, &k, &f);
          ASSERT_LE(ELVerrno, 4);
        }
      }
    }
  } catch (const std::exception& e) {
    ADD_FAILURE() << "trap: " << e.what() << " after " << runs << " runs";
  }
  qel::ResetFpuStates();
}

}  // namespace
