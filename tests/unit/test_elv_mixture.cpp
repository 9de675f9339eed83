// The two-stage Poisson-mixture sums on components with a closed-form total:
// with F(j) = r^j the mixture sum over all j of Poisson(j; L) r^j is
// exp(-L (1 - r)). Decreasing components (r < 1) suit the descending sum,
// increasing ones (r > 1) the ascending sum. Also the failure ends that the
// noncentral routines map to their method numbers.
#include <gtest/gtest.h>

#include <cmath>

#include "utilities/elv/mixture.h"

namespace {

using qel::elv::MixtureEnd;
using qel::elv::MixtureSettings;

// F(j) = r^j scaled by 10^logScale; the "series" is the constant factor 1.
class Geometric : public qel::elv::MixtureComponents {
 public:
  Geometric(double r, bool descending, double logScale = 0.0, int seriesStatus = 0)
      : r_(r), descending_(descending), logScale_(logScale), seriesStatus_(seriesStatus) {}
  int series(long, double* factor) const override {
    *factor = 1.0;
    return seriesStatus_;
  }
  double step(long, double*) const override { return descending_ ? 1.0 / r_ : r_; }
  double logComponent(long j, double) const override { return j * std::log(r_) + logScale_; }

 private:
  double r_;
  bool descending_;
  double logScale_;
  int seriesStatus_;
};

MixtureSettings settingsFor(double L) {
  MixtureSettings s;
  s.L = L;
  s.switchAbove = 1e300;
  return s;
}

TEST(ElvMixtureSum, DescendingSumOfDecreasingComponents) {
  for (double L : {0.3, 4.0, 250.0, 1e5}) {
    for (double r : {0.999, 0.9, 0.5}) {
      const long k = qel::elv::descendingMixtureStart(L);
      ASSERT_GE(k, 0);
      const auto result = qel::elv::descendingMixtureSum(Geometric(r, true), k, settingsFor(L));
      const double expected = std::exp(-L * (1 - r));
      if (expected < 1e-290) {
        EXPECT_EQ(result.end, MixtureEnd::Underflow) << L << ", " << r;
        continue;
      }
      ASSERT_EQ(result.end, MixtureEnd::Normal) << L << ", " << r;
      EXPECT_NEAR(result.sum / expected, 1.0, 2e-9) << L << ", " << r;
      EXPECT_GE(result.start, result.peak);
      EXPECT_GE(result.peak, result.last);
    }
  }
}

TEST(ElvMixtureSum, AscendingSumOfIncreasingComponents) {
  for (double L : {0.3, 4.0, 250.0, 1e5}) {
    for (double r : {1.0, 1.001, 1.5}) {
      const long k = qel::elv::ascendingMixtureStart(L);
      ASSERT_GE(k, 0);
      // Scaled so that the total stays at or below 1.
      const double logScale = -L * (r - 1);
      const auto result =
          qel::elv::ascendingMixtureSum(Geometric(r, false, logScale), k, settingsFor(L));
      ASSERT_EQ(result.end, MixtureEnd::Normal) << L << ", " << r;
      EXPECT_NEAR(result.sum, 1.0, 2e-9) << L << ", " << r;
      EXPECT_LE(result.start, result.peak);
      EXPECT_LE(result.peak, result.last);
    }
  }
}

TEST(ElvMixtureSum, FailureEnds) {
  const MixtureSettings s = settingsFor(50.0);
  const long down = qel::elv::descendingMixtureStart(50.0);
  const long up = qel::elv::ascendingMixtureStart(50.0);
  // A failing series: -1.
  auto result = qel::elv::descendingMixtureSum(Geometric(0.5, true, 0.0, 4), down, s);
  EXPECT_EQ(result.end, MixtureEnd::SeriesFailed);
  EXPECT_EQ(result.sum, -1.0);
  result = qel::elv::ascendingMixtureSum(Geometric(1.5, false, 0.0, 4), up, s);
  EXPECT_EQ(result.end, MixtureEnd::SeriesFailed);
  // A failed start index: -1.
  result = qel::elv::descendingMixtureSum(Geometric(0.5, true), -1, s);
  EXPECT_EQ(result.end, MixtureEnd::StartFailed);
  EXPECT_EQ(result.sum, -1.0);
  // An underflowing peak: 0.
  result = qel::elv::descendingMixtureSum(Geometric(0.5, true, -700.0), down, s);
  EXPECT_EQ(result.end, MixtureEnd::Underflow);
  EXPECT_EQ(result.sum, 0.0);
  // The cap of the ascending index, in the walk and in the summing stage: -2.
  MixtureSettings capped = s;
  capped.cap = up + 3;
  result = qel::elv::ascendingMixtureSum(Geometric(1.5, false, -25.0), up, capped);
  EXPECT_EQ(result.end, MixtureEnd::CapReached);
  EXPECT_FALSE(result.inSecondStage);
  EXPECT_EQ(result.sum, -2.0);
  capped.cap = 80;  // beyond the peak near 75, before the end of the sum
  result = qel::elv::ascendingMixtureSum(Geometric(1.5, false, -25.0), up, capped);
  EXPECT_EQ(result.end, MixtureEnd::CapReached);
  EXPECT_TRUE(result.inSecondStage);
  // A running sum above the switch limit ends at once.
  MixtureSettings switching = s;
  switching.switchAbove = 0.5;
  result = qel::elv::descendingMixtureSum(Geometric(0.9999, true), down, switching);
  EXPECT_EQ(result.end, MixtureEnd::AboveLimit);
  EXPECT_GT(result.sum, 0.5);
}

// Weights with the shift 1/2 of the noncentral t: the sum over j of
// L^(j+1/2) e^-L / Gamma(j+3/2) is erf(sqrt(L)).
TEST(ElvMixtureSum, HalfShiftedWeights) {
  for (double L : {0.5, 8.0, 300.0}) {
    MixtureSettings s = settingsFor(L);
    s.weightShift = 0.5;
    const long k = qel::elv::descendingMixtureStart(L);
    const auto result = qel::elv::descendingMixtureSum(Geometric(1.0, true), k, s);
    ASSERT_EQ(result.end, MixtureEnd::Normal);
    EXPECT_NEAR(result.sum / std::erf(std::sqrt(L)), 1.0, 2e-9) << L;
  }
}

}  // namespace
