// The incomplete gamma ratio (ACM TOMS 654 at its first accuracy level)
// against mpmath over every region, with its failure texts and edge values.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <map>
#include <stdexcept>
#include <string>
#include <vector>

#include "reference_data.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/higher_functions/transcendental.h"

namespace {

template <class E, class F>
std::string messageOf(F f) {
  try {
    f();
  } catch (const E& e) {
    return e.what();
  }
  return "<no exception>";
}

// 1e-13 relative, plus one rounding of x/a (or of a ln x - x) through the
// condition number of P: for a = 1e6 near x = a that is about 1e-12.
constexpr double kTolerance = 1e-13;
constexpr double kRounding = 2.3e-16;

TEST(IncompleteGamma, EveryRegionMatchesHighPrecisionValues) {
  const auto rows = qeltest::loadReferenceData("incomplete_gamma.csv", 1);
  std::map<std::string, double> worst;
  std::map<std::string, int> count;
  for (const auto& row : rows) {
    const std::string& region = row.text[0];
    const double a = row.numbers[0], x = row.numbers[1], p = row.numbers[2];
    const double cond = row.numbers[4];
    const double actual = qel::mIncompleteGamma(x, a);
    const double error = qeltest::relativeError(actual, p);
    worst[region] = std::max(worst[region], error);
    ++count[region];
    // Temme's expansion is truncated after u^7: at a = 20 and |1 - x/a| = 0.4,
    // the corner of its region, that leaves 1.5e-13.
    const double base = (region == "temme" && a < 50.0) ? 2e-13 : kTolerance;
    EXPECT_LE(error, base + kRounding * cond) << region << " P(" << a << ", " << x << ") line "
                                              << row.line << " got " << actual << " want " << p;
  }
  for (const char* region : {"a_half", "a_small_series", "a_small_fraction", "finite_sum", "taylor",
                             "fraction", "asymptotic", "temme_centre", "temme", "large_a_series"}) {
    EXPECT_GE(count[region], 10) << "too few points in " << region;
  }
  for (const auto& [region, error] : worst) {
    std::printf("  %-18s %4d points, max relative error %.2e\n", region.c_str(), count[region],
                error);
  }
}

TEST(IncompleteGamma, FailureTexts) {
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mIncompleteGamma(1.0, -0.5); }), "dP < 0");
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mIncompleteGamma(-1.0, 2.0); }), "dX < 0");
  // dP is checked first.
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mIncompleteGamma(-1.0, -1.0); }), "dP < 0");
  EXPECT_EQ(messageOf<std::invalid_argument>([] { qel::mIncompleteGamma(0.0, 0.0); }),
            "dX and dP both 0");
  // x = a beyond 1/(eps^2) is indeterminate at this accuracy.
  EXPECT_EQ(messageOf<std::runtime_error>([] { qel::mIncompleteGamma(1e30, 1e30); }),
            "no convergence");
}

TEST(IncompleteGamma, EdgeValues) {
  EXPECT_EQ(qel::mIncompleteGamma(0.0, 3.0), 0.0);
  EXPECT_EQ(qel::mIncompleteGamma(2.0, 0.0), 1.0);
  // a = 1/2, x = 1/4 takes the erfc side: P = erf(1/2).
  EXPECT_NEAR(qel::mIncompleteGamma(0.25, 0.5), 0.52049987781304653768, 4e-16);
  EXPECT_NEAR(qel::mIncompleteGamma(0.2499, 0.5), std::erf(std::sqrt(0.2499)), 4e-16);
  // Integer a: P(1, x) = 1 - exp(-x).
  EXPECT_NEAR(qel::mIncompleteGamma(3.0, 1.0), 1.0 - std::exp(-3.0), 1e-16);
  // Far tails collapse to the limit values.
  EXPECT_EQ(qel::mIncompleteGamma(1e-300, 100.0), 0.0);
  EXPECT_EQ(qel::mIncompleteGamma(1e4, 100.0), 1.0);
  EXPECT_TRUE(std::isnan(qel::mIncompleteGamma(std::nan(""), 2.0)));
}

}  // namespace

namespace {

// Kernels call these inside the armed frame, where an overflow or invalid
// operation traps: no reference point may trap, and the answers stand.
TEST(IncompleteGamma, ArmedFrameDoesNotTrap) {
  const auto rows = qeltest::loadReferenceData("incomplete_gamma.csv", 1);
  qel::SetLynFpuStates();
  int close = 0;
  for (const auto& row : rows) {
    const double p = qel::mIncompleteGamma(row.numbers[1], row.numbers[0]);
    close += (std::fabs(p - row.numbers[2]) <= 1e-12 * row.numbers[2] + 1e-300);
  }
  std::vector<double> out;
  int nz = 0;
  for (double x : {1e-5, 0.7, 3.0, 45.0, 1e10, 1e300}) {
    qel::mPsiDerivatives(x, 0, false, 6, out, nz);
    qel::mPsiDerivatives(x, 30, true, 3, out, nz);
  }
  qel::ResetFpuStates();
  EXPECT_EQ(close, static_cast<int>(rows.size()));
}

}  // namespace
