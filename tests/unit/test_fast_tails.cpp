// The fast tail kernels of the gamma, beta, binomial, Poisson,
// hypergeometric and t laws (their accuracy is checked on the mpmath grids of
// test_exported_families.cpp): the historical ELV setting keeps the ELV
// routes, deep tails and refused arguments fall back, and the two tails of
// the discrete laws complement each other over the whole support.
#include <gtest/gtest.h>
#include <qel/distributions.h>
#include <qel/elv.h>

#include <cmath>

#include "utilities/distributions/beta_ratio.h"
#include "utilities/distributions/gamma_ratio.h"
#include "utilities/distributions/kernels.h"
#include "utilities/elv/precision.h"

namespace {

using qel::elv::ElvPrecision;

TEST(FastTails, HistoricalSettingKeepsTheElvRoutes) {
  const qel::elv::ScopedElvPrecision scope(ElvPrecision::Historical);
  double lower = 0.0, upper = 0.0, density = 0.0, mass = 0.0;
  EXPECT_FALSE(qel::gammaratio::fastTails(4.5, 3.0, &lower, &upper));
  EXPECT_FALSE(qel::betaratio::fastTails(2.5, 7.0, 0.3, 0.7, &lower, &upper));
  gamma_df(3.0, 4.5, &lower, &upper, &density);
  EXPECT_EQ(qel::mGammaCdf(3.0, 4.5, 1.0, 0.0, false), lower);
  beta_df(0.3, 2.5, 7.0, &lower, &upper, &density);
  EXPECT_EQ(qel::mBetaCdf(0.3, 2.5, 7.0, true), upper);
  binomial_df(55, 200, 0.3, &lower, &upper, &mass);
  EXPECT_EQ(qel::mBinomialCdf(55.0, 200.0, 0.3, false), lower);
  hypergeo_df(60, 1000, 400, 150, &lower, &upper, &mass);
  EXPECT_EQ(qel::mHypergeometricCdf(60.0, 1000, 400, 150, false), lower);
}

TEST(FastTails, DeepTailsAndRefusedArgumentsFallBack) {
  double lower = 0.0, upper = 0.0;
  // P(300, 1) is about 1/300!, far below 1e-280: left to the ELV routine.
  EXPECT_FALSE(qel::gammaratio::tails(300.0, 1.0, &lower, &upper));
  EXPECT_FALSE(qel::gammaratio::tails(NAN, 1.0, &lower, &upper));
  EXPECT_FALSE(qel::gammaratio::tails(2.0, INFINITY, &lower, &upper));
  EXPECT_FALSE(qel::betaratio::fastTails(0.0, 2.0, 0.5, 0.5, &lower, &upper));
  EXPECT_FALSE(qel::betaratio::fastTails(2.0, 2.0, 0.0, 1.0, &lower, &upper));
  // Through the fallback the exported tail is 0 below the double range
  // (distribution_body.csv checks tails from 1e-308 to 1e-280 on this path).
  EXPECT_EQ(qel::GammaCdf(1.0, 300.0, 1.0, 0.0, false), 0.0);
}

// lower(k) + upper(k + 1) = 1 wherever one tail is formed directly and the
// other as a complement, on both sides of the switch at the mode.
TEST(FastTails, DiscreteTailsComplementOverTheSupport) {
  struct Law {
    const char* name;
    double last;
    double (*cdf)(double, bool);
  };
  const Law laws[] = {
      {"binomial", 200.0, [](double k, bool u) { return qel::BinomialCdf(k, 200.0, 0.3, u); }},
      {"poisson", 120.0, [](double k, bool u) { return qel::PoissonCdf(k, 40.0, u); }},
      {"hypergeometric", 150.0,
       [](double k, bool u) { return qel::HypergeometricCdf(k, 1000, 400, 150, u); }},
      {"hypergeometric, support from 2", 10.0,
       [](double k, bool u) { return qel::HypergeometricCdf(k, 20, 12, 10, u); }},
  };
  for (const Law& law : laws) {
    double previous = 0.0;
    for (double k = 0.0; k <= law.last; k += 1.0) {
      const double lower = law.cdf(k, false), above = law.cdf(k + 1.0, true);
      EXPECT_NEAR(lower + above, 1.0, 4e-16) << law.name << " at " << k;
      EXPECT_GE(lower, previous) << law.name << " at " << k;
      previous = lower;
    }
    EXPECT_EQ(law.cdf(law.last, false), 1.0) << law.name;
    EXPECT_EQ(law.cdf(0.0, true), 1.0) << law.name;
  }
}

}  // namespace
