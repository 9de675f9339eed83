// Range checks, special cases, method numbers and step counters of the gamma,
// Poisson and chi-square ELV routines; the values themselves are checked
// against mpmath in test_elv_gamma_accuracy.cpp.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/elv.h>

#include <climits>
#include <cmath>
#include <limits>

#include "utilities/elv/precision.h"
#include "utilities/elv/wrappers.h"

namespace {

constexpr double kHuge = 1.7976931348623157e308;
const double kNaN = std::numeric_limits<double>::quiet_NaN();

struct Tails {
  double lower = -7, upper = -7, density = -7;
};

Tails gammaDf(double x, double a) {
  Tails t;
  gamma_df(x, a, &t.lower, &t.upper, &t.density);
  return t;
}

Tails gammaNcdf(double x, double a, double L) {
  Tails t;
  gamma_ncdf(x, a, L, &t.lower, &t.upper);
  return t;
}

Tails poissonDf(long k, double m) {
  Tails t;
  poisson_df(k, m, &t.lower, &t.upper, &t.density);
  return t;
}

TEST(ElvGammaDf, RefusedArgumentsLeaveTheOutputs) {
  for (const auto& [x, a] :
       {std::pair{1.0, 0.0}, {-1.0, 2.0}, {1.0, 94906265.5}, {kNaN, 1.0}, {1.0, kNaN}}) {
    const Tails t = gammaDf(x, a);
    EXPECT_EQ(ELVerrno, 2) << x << ", " << a;
    EXPECT_EQ(ELVmethod, 0);
    EXPECT_STREQ(ELVroutine, "gamma_df");
    EXPECT_EQ(t.lower, -7.0);
    EXPECT_EQ(t.upper, -7.0);
    EXPECT_EQ(t.density, -7.0);
  }
  gammaDf(94906265.0, 94906265.0);  // the largest shape itself is admitted
  EXPECT_EQ(ELVerrno, 0);
}

TEST(ElvGammaDf, ZeroAndHugeArguments) {
  Tails t = gammaDf(0.0, 3.0);
  EXPECT_EQ(ELVerrno, 0);
  EXPECT_EQ(ELVmethod, 1);
  EXPECT_EQ(t.lower, 0.0);
  EXPECT_EQ(t.upper, 1.0);
  EXPECT_EQ(t.density, -7.0);  // left as it was
  t = gammaDf(1e-290, 0.001);  // below the smallest argument: counts as 0
  EXPECT_EQ(ELVmethod, 1);
  EXPECT_EQ(t.lower, 0.0);
  t = gammaDf(189812531.0, 5.0);
  EXPECT_EQ(ELVmethod, 2);
  EXPECT_EQ(t.lower, 1.0);
  EXPECT_EQ(t.upper, 0.0);
  EXPECT_EQ(t.density, 0.0);
}

// One point in each branch: (x, a, method, code).
TEST(ElvGammaDf, MethodNumbersOfTheBranches) {
  const qel::elv::ScopedElvPrecision historical(qel::elv::ElvPrecision::Historical);
  struct Case {
    double x, a;
    int method, code;
  };
  const Case cases[] = {
      {0.5, 1.0, 10, 0},                  // lower series
      {1.0, 1000.0, 20, 1},               // lower tail below the limit by the bound
      {89657050.987754732, 9e7, 40, 0},   // lower series rescues an underflowed density
      {0.5, 0.3, 50, 0},                  // small shape and argument: power series
      {200.0, 10.5, 60, 0},               // upper, finite sum
      {3.0, 1.0, 61, 0},                  // upper, continued fraction
      {0.9, 1.2, 62, 0},                  // upper, power series start
      {800.0, 0.5, 70, 1},                // upper underflow with a <= 1
      {2000.0, 10.0, 80, 1},              // upper underflow by the bound
      {90343423.353894278, 9e7, 100, 0},  // upper series rescues an underflowed density
  };
  for (const Case& c : cases) {
    const Tails t = gammaDf(c.x, c.a);
    EXPECT_EQ(ELVmethod, c.method) << c.x << ", " << c.a;
    EXPECT_EQ(ELVerrno, c.code) << c.x << ", " << c.a;
    EXPECT_EQ(t.lower + t.upper, 1.0) << c.x << ", " << c.a;
  }
  // The lower series reports its length.
  gammaDf(50.0, 100.0);
  EXPECT_GT(ELVsteps1, 10);
  EXPECT_LT(ELVsteps1, 1000);
}

TEST(ElvGammaNcdf, RangeAndWidthChecks) {
  gammaNcdf(1.0, -1.0, 1.0);
  EXPECT_EQ(ELVerrno, 2);
  gammaNcdf(1.0, 1.0, -1.0);
  EXPECT_EQ(ELVerrno, 2);
  gammaNcdf(kNaN, 1.0, 1.0);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_STREQ(ELVroutine, "gamma_ncdf");
  // a + L + 6.1738 sqrt(L) beyond 94906265: code 3.
  gammaNcdf(1e8, 1.0, 94906265.0 - 1.0 - 6.1738 * std::sqrt(94906265.0) + 100.0);
  EXPECT_EQ(ELVerrno, 3);
  gammaNcdf(94000000.0, 1.0, 94000000.0);
  EXPECT_EQ(ELVerrno, 0);
}

TEST(ElvGammaNcdf, SpecialCases) {
  // L = 0 is the central law, under gamma_df's status.
  const Tails central = gammaDf(3.0, 2.5);
  const Tails t = gammaNcdf(3.0, 2.5, 0.0);
  EXPECT_EQ(t.lower, central.lower);
  EXPECT_EQ(t.upper, central.upper);
  gammaNcdf(0.0, 2.5, 4.0);
  EXPECT_EQ(ELVmethod, 1);
  EXPECT_EQ(ELVsteps1, 0);
  const Tails huge = gammaNcdf(2e8, 2.5, 4.0);
  EXPECT_EQ(ELVmethod, 2);
  EXPECT_EQ(huge.lower, 1.0);
  EXPECT_EQ(huge.upper, 0.0);
}

TEST(ElvGammaNcdf, TailChoiceAndCounters) {
  // x = a + L takes the lower tail, summed from the top: start >= peak >= end.
  gammaNcdf(110.0, 100.0, 10.0);
  EXPECT_EQ(ELVmethod, 13);
  EXPECT_GE(ELVsteps1, ELVsteps2);
  EXPECT_GE(ELVsteps2, ELVsteps3);
  // Just above it the upper tail, summed from the bottom: start <= peak <= end.
  gammaNcdf(111.0, 100.0, 10.0);
  EXPECT_EQ(ELVmethod, 24);
  EXPECT_LE(ELVsteps1, ELVsteps2);
  EXPECT_LE(ELVsteps2, ELVsteps3);
  // A lower sum that passes 0.9 hands over to the upper one: 100 + 24.
  Tails t = gammaNcdf(0.02, 0.01, 0.01);
  EXPECT_EQ(ELVmethod, 124);
  EXPECT_GT(t.lower, 0.9);
  EXPECT_EQ(t.lower, 1.0 - t.upper);
  // Underflowing peaks: code 1 with exact 0 and 1.
  t = gammaNcdf(1e-3, 100.0, 1e4);
  EXPECT_EQ(ELVmethod, 12);
  EXPECT_EQ(ELVerrno, 1);
  EXPECT_EQ(t.lower, 0.0);
  EXPECT_EQ(t.upper, 1.0);
  t = gammaNcdf(1e5, 100.0, 1e4);
  EXPECT_EQ(ELVmethod, 23);
  EXPECT_EQ(ELVerrno, 1);
  EXPECT_EQ(t.upper, 0.0);
}

TEST(ElvChiSquare, ChecksAndReductionToGamma) {
  double lower = -7, upper = -7, density = -7;
  chi2_df(1.0, 189812531.0, &lower, &upper, &density);
  EXPECT_EQ(ELVerrno, 2);
  chi2_df(-1.0, 2.0, &lower, &upper, &density);
  EXPECT_EQ(ELVerrno, 2);
  // The width test of chi2_ncdf takes L itself, gamma_ncdf's L/2.
  const double L = 9.49e7;
  chi2_ncdf(1e8, 2.0, L, &lower, &upper);
  EXPECT_EQ(ELVerrno, 3);
  gamma_ncdf(L / 2, 1.0, L / 2, &lower, &upper);
  EXPECT_EQ(ELVerrno, 0);
  // With L = 0 the noncentral form equals the central one.
  double cLower, cUpper, cDensity;
  chi2_df(7.5, 3.0, &cLower, &cUpper, &cDensity);
  chi2_ncdf(7.5, 3.0, 0.0, &lower, &upper);
  EXPECT_EQ(lower, cLower);
  EXPECT_EQ(upper, cUpper);
  // At 0 the density is left as it was (the gamma law does not write it).
  density = -7;
  chi2_df(0.0, 3.0, &lower, &upper, &density);
  EXPECT_EQ(density, -7.0);
  EXPECT_EQ(lower, 0.0);
}

TEST(ElvPoissonDf, ChecksAndZeroMean) {
  poissonDf(3, -1.0);
  EXPECT_EQ(ELVerrno, 2);
  poissonDf(94906266, 10.0);
  EXPECT_EQ(ELVerrno, 2);
  poissonDf(94906265, 94906265.0);
  EXPECT_EQ(ELVerrno, 0);
  Tails t = poissonDf(0, 0.0);
  EXPECT_EQ(t.density, 1.0);
  EXPECT_EQ(t.lower, 1.0);
  EXPECT_EQ(t.upper, 0.0);
  EXPECT_EQ(ELVmethod, 1);
  EXPECT_EQ(ELVsteps1, 0);
  t = poissonDf(4, 0.0);
  EXPECT_EQ(t.density, 0.0);
  // Counts beyond the signed range reach the routine as refused counts.
  double lower, upper, mass;
  EXPECT_EQ(qel::elv_poisson_df(ULONG_MAX, 10.0, &lower, &upper, &mass), qel::ElvArgumentOutOfRange);
}

TEST(ElvPoissonDf, MethodNumbersOfTheBranches) {
  struct Case {
    long k;
    double m;
    int method, code;
  };
  const Case cases[] = {
      {5, 10.0, 10, 0},  {0, 800.0, 11, 1},     {89657417, 9e7, 13, 0},
      {20, 10.0, 20, 0}, {3000, 1000.0, 21, 1}, {90342982, 9e7, 23, 0},
  };
  for (const Case& c : cases) {
    const Tails t = poissonDf(c.k, c.m);
    EXPECT_EQ(ELVmethod, c.method) << c.k << ", " << c.m;
    EXPECT_EQ(ELVerrno, c.code) << c.k << ", " << c.m;
    EXPECT_EQ(t.lower + t.upper, 1.0);
  }
}

TEST(ElvPoissonQuantiles, RangesAndTheSmallMeanStart) {
  long k = -1;
  double f = -1;
  poisson_upper_quant(&k, &f, 0.6, 3.0);
  EXPECT_EQ(ELVerrno, 2);
  poisson_lower_quant(&k, &f, 1e-13, 3.0);
  EXPECT_EQ(ELVerrno, 2);
  poisson_lower_quant(&k, &f, 0.1, 94906266.0);
  EXPECT_EQ(ELVerrno, 2);
  // A mean of 36 starts at 0 and reaches the median 36 within 40 steps.
  poisson_lower_quant(&k, &f, 0.5, 36.0);
  EXPECT_EQ(ELVerrno, 0);
  EXPECT_EQ(k, 36);
  EXPECT_EQ(ELVsteps1, 36);
  EXPECT_GE(f, 0.0);
  EXPECT_LT(f, 1.0);
}

TEST(ElvGammaQuantiles, RangesAndFailureValue) {
  for (const auto& [p, a] :
       {std::pair{0.6, 2.0}, {1e-13, 2.0}, {0.1, 0.0}, {0.1, 94906265.0}, {kNaN, 2.0}}) {
    double q = 0;
    gamma_upper_quant(p, a, &q);
    EXPECT_EQ(ELVerrno, 2);
    EXPECT_EQ(q, -kHuge);
    q = 0;
    gamma_lower_quant(p, a, &q);
    EXPECT_EQ(ELVerrno, 2);
    EXPECT_EQ(q, -kHuge);
    q = 0;
    chi2_lower_quant(p, 2 * a, &q);
    EXPECT_EQ(ELVerrno, 2);
    EXPECT_EQ(q, -kHuge);
  }
}

TEST(ElvGammaQuantiles, MethodNumbersOfTheBranches) {
  struct Case {
    bool upper;
    double p, a;
    int method, code;
  };
  const Case cases[] = {
      {true, 0.1, 1e-15, 0, 1},   {true, 1e-3, 0.5, 1, 0},     {true, 0.5, 0.01, 3, 0},
      {true, 0.3, 0.1, 4, 0},     {true, 1e-3, 1e5, 5, 0},     {true, 1e-3, 50.0, 6, 0},
      {false, 0.5, 0.001, 0, 1},  {false, 1e-12, 0.002, 1, 1}, {false, 0.01, 0.01, 2, 0},
      {false, 0.1, 0.5, 3, 0},    {false, 0.1, 5.0, 4, 0},     {false, 0.1, 1e5, 5, 0},
      {false, 1e-12, 10.5, 6, 0},
  };
  for (const Case& c : cases) {
    double q = -1;
    if (c.upper) {
      gamma_upper_quant(c.p, c.a, &q);
    } else {
      gamma_lower_quant(c.p, c.a, &q);
    }
    EXPECT_EQ(ELVmethod, c.method) << c.upper << " " << c.p << ", " << c.a;
    EXPECT_EQ(ELVerrno, c.code) << c.upper << " " << c.p << ", " << c.a;
    if (c.code == 1) {
      EXPECT_EQ(q, 0.0);
    }
  }
}

TEST(ElvNormalQuantiles, RangeLinearFormAndSymmetry) {
  const qel::elv::ScopedElvPrecision historical(qel::elv::ElvPrecision::Historical);
  double z = 0;
  normal_upper_quant(0.6, &z);
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_EQ(z, -kHuge);
  normal_upper_quant(1e-101, &z);
  EXPECT_EQ(ELVerrno, 2);
  // Where 1 - 2p is at most 1e-5 the quantile is linear in it.
  normal_upper_quant(0.4999999, &z);
  EXPECT_EQ(z, 1.2533141373155003 * (1.0 - 2 * 0.4999999));
  double lower = 0;
  normal_upper_quant(0.025, &z);
  normal_lower_quant(0.025, &lower);
  EXPECT_EQ(lower, -z);
  EXPECT_NEAR(z, 1.959963984540054, 2e-10);  // the familiar 97.5% point
  normal_lower_quant(2.0, &lower);
  EXPECT_STREQ(ELVroutine, "normal_lower_quant");
  errno = 0;
  EXPECT_EQ(inv_normal_df0(1.0), -kHuge);
  EXPECT_EQ(errno, 33);
}

// No argument, however bad, may raise a floating-point trap in the armed
// state: every routine answers through its status instead.
TEST(ElvGammaFamily, BadArgumentsDoNotTrapWhenArmed) {
  const double bad[] = {kNaN,   -1.0,  0.0, 1e-320,
                        1e-300, 1e300, 2e8, std::numeric_limits<double>::infinity()};
  int runs = 0;
  qel::SetLynFpuStates();
  try {
    for (double u : bad) {
      for (double v : bad) {
        double a = 0, b = 0, c = 0;
        long k = 0;
        gamma_df(u, v, &a, &b, &c);
        gamma_ncdf(u, v, 1.0, &a, &b);
        gamma_ncdf(1.0, u, v, &a, &b);
        chi2_ncdf(u, 3.0, v, &a, &b);
        gamma_upper_quant(u, v, &a);
        gamma_lower_quant(u, v, &a);
        poisson_df(3, u, &a, &b, &c);
        poisson_upper_quant(&k, &a, u, v);
        poisson_lower_quant(&k, &a, u, v);
        gamma_ncdf(1.8e8, u, 1.0, &a, &b);  // tiny shapes in the ascending sum
        ++runs;
      }
    }
  } catch (const std::exception& e) {
    ADD_FAILURE() << "trap: " << e.what() << " after " << runs << " runs";
  }
  qel::ResetFpuStates();
  EXPECT_EQ(runs, 64);
}

}  // namespace
