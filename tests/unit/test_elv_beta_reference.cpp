// Accuracy of the beta, binomial and F routines against mpmath reference
// values (tools/reference/gen_elv_beta.py). Every routine runs in the armed
// floating-point state, as it does under the exported functions, so that a
// trap inside it fails the test. Where the status is 0 each tail must be
// within 1e-8 relative error; where it is 1 the tail set to 0 must indeed be
// below the smallest representable result; quantiles must reproduce their
// probability to 1e-9 relative. The largest errors are printed.
#include <gtest/gtest.h>
#include <qel/distributions.h>
#include <qel/elv.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <functional>
#include <set>
#include <stdexcept>
#include <string>

#include "reference_data.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

constexpr double kTailTolerance = 1e-8;
constexpr double kQuantileTolerance = 1e-9;
// Results below exp(-662.34472) are reported as 0 with status 1.
constexpr double kUnderflowed = 2.3e-288;
constexpr double kTiny = 2.2250738585072014e-288;

// Runs op in the armed state; a trap becomes a test failure.
void armed(const std::function<void()>& op, int line) {
  qel::SetLynFpuStates();
  try {
    op();
  } catch (const std::exception& e) {
    ADD_FAILURE() << "data line " << line << ": trap " << e.what();
  }
  qel::ResetFpuStates();
}

void report(const char* what, double worst, int rows) {
  std::printf("[ max error ] %-28s %.3e over %d status-0 rows\n", what, worst, rows);
}

// Checks a pair of tails; returns the larger relative error for status 0.
double checkTails(int line, int status, double lower, double upper, double refLower,
                  double refUpper) {
  if (status == 1) {
    const bool lowerZeroed = lower == 0.0 && upper == 1.0 && refLower < kUnderflowed;
    const bool upperZeroed = upper == 0.0 && lower == 1.0 && refUpper < kUnderflowed;
    EXPECT_TRUE(lowerZeroed || upperZeroed)
        << "line " << line << ": status 1 with " << lower << ", " << upper;
    return 0.0;
  }
  EXPECT_EQ(status, 0) << "line " << line;
  const double e = std::max(relativeError(lower, refLower), relativeError(upper, refUpper));
  EXPECT_LE(e, kTailTolerance) << "line " << line << ": " << lower << " vs " << refLower << ", "
                               << upper << " vs " << refUpper;
  return e;
}

TEST(ElvBetaReference, IncompleteBetaRatioAndDensity) {
  const auto rows = loadReferenceData("elv_beta_df.csv", 0);
  ASSERT_GT(rows.size(), 300u);
  double worst = 0.0, worstDensity = 0.0;
  int counted = 0;
  for (const auto& r : rows) {
    const double x = r.numbers[0], a = r.numbers[1], b = r.numbers[2];
    double lower = -1, upper = -1, density = -1;
    armed([&] { beta_df(x, a, b, &lower, &upper, &density); }, r.line);
    if (x < kTiny) {  // counts as 0
      EXPECT_EQ(ELVerrno, 0);
      EXPECT_EQ(lower, 0.0);
      EXPECT_EQ(upper, 1.0);
      continue;
    }
    const double e = checkTails(r.line, ELVerrno, lower, upper, r.numbers[3], r.numbers[4]);
    if (ELVerrno != 0) continue;
    ++counted;
    worst = std::max(worst, e);
    const double refDensity = r.numbers[5];
    if (refDensity < kUnderflowed) {
      EXPECT_EQ(density, 0.0) << "line " << r.line;
    } else {
      const double ed = relativeError(density, refDensity);
      EXPECT_LE(ed, kTailTolerance) << "line " << r.line;
      worstDensity = std::max(worstDensity, ed);
    }
  }
  report("beta_df tails", worst, counted);
  report("beta_df density", worstDensity, counted);
  EXPECT_GT(counted, 250);
}

TEST(ElvBetaReference, NoncentralBetaTails) {
  const auto rows = loadReferenceData("elv_beta_ncdf.csv", 0);
  ASSERT_GT(rows.size(), 50u);
  double worst = 0.0;
  int counted = 0;
  std::set<long long> methods;
  for (const auto& r : rows) {
    const double x = r.numbers[0], a = r.numbers[1], b = r.numbers[2], L = r.numbers[3];
    double lower = -1, upper = -1;
    armed([&] { beta_ncdf(x, a, b, L, &lower, &upper); }, r.line);
    if (x < kTiny) {  // counts as 0
      EXPECT_EQ(ELVerrno, 0);
      EXPECT_EQ(lower, 0.0);
      continue;
    }
    const double e = checkTails(r.line, ELVerrno, lower, upper, r.numbers[4], r.numbers[5]);
    methods.insert(ELVmethod);
    if (ELVerrno == 0) {
      ++counted;
      worst = std::max(worst, e);
    }
  }
  report("beta_ncdf tails", worst, counted);
  // Both directions, both routines, with and without the hand-over.
  for (long long m : {13LL, 24LL, 1013LL, 1024LL}) EXPECT_TRUE(methods.count(m)) << m;
  EXPECT_TRUE(methods.count(113) || methods.count(124) || methods.count(1113) ||
              methods.count(1124));
}

TEST(ElvBetaReference, BinomialTailsAndMass) {
  const auto rows = loadReferenceData("elv_binomial_df.csv", 0);
  ASSERT_GT(rows.size(), 100u);
  double worst = 0.0, worstMass = 0.0;
  int counted = 0;
  for (const auto& r : rows) {
    const long k = static_cast<long>(r.numbers[0]), n = static_cast<long>(r.numbers[1]);
    const double prob = r.numbers[2];
    double lower = -1, upper = -1, mass = -1;
    armed([&] { binomial_df(k, n, prob, &lower, &upper, &mass); }, r.line);
    const double e = checkTails(r.line, ELVerrno, lower, upper, r.numbers[3], r.numbers[4]);
    const double refMass = r.numbers[5];
    if (refMass >= kUnderflowed) {
      const double em = relativeError(mass, refMass);
      EXPECT_LE(em, kTailTolerance) << "line " << r.line;
      worstMass = std::max(worstMass, em);
    }
    if (ELVerrno == 0) {
      ++counted;
      worst = std::max(worst, e);
    }
  }
  report("binomial_df tails", worst, counted);
  report("binomial_df mass", worstMass, counted);
}

TEST(ElvBetaReference, FTailsCentralAndNoncentral) {
  const auto rows = loadReferenceData("elv_F_df.csv", 0);
  ASSERT_GT(rows.size(), 50u);
  double worstCentral = 0.0, worstNoncentral = 0.0;
  int counted = 0;
  for (const auto& r : rows) {
    const double x = r.numbers[0], df1 = r.numbers[1], df2 = r.numbers[2], L = r.numbers[3];
    double lower = -1, upper = -1;
    armed([&] { F_ncdf(x, df1, df2, L, &lower, &upper); }, r.line);
    const double e = checkTails(r.line, ELVerrno, lower, upper, r.numbers[4], r.numbers[5]);
    if (ELVerrno != 0) continue;
    ++counted;
    if (L == 0.0) {
      worstCentral = std::max(worstCentral, e);
      double l2 = -1, u2 = -1;
      armed([&] { F_df(x, df1, df2, &l2, &u2); }, r.line);
      EXPECT_EQ(l2, lower);
      EXPECT_EQ(u2, upper);
    } else {
      worstNoncentral = std::max(worstNoncentral, e);
    }
  }
  report("F_df tails", worstCentral, counted);
  report("F_ncdf tails (L > 0)", worstNoncentral, counted);
}

// Relative error in probability of a quantile q against the reference q*:
// |q - q*| f(q*)/p, with the slope f(q*)/p stored with the reference.
double probabilityError(double q, double reference, double slope) {
  return std::fabs(q - reference) * slope;
}

// Error in probability of a quantile q of reference x, beyond the spacing
// of doubles at q (a quantile within 1e-300 of 1 can only be 1).
double quantileError(double q, double x, double slope) {
  const double spacing = std::fabs(std::nextafter(q, 2.0) - q);
  const double beyond = std::fabs(q - x) - spacing;
  return beyond > 0.0 ? beyond * slope : 0.0;
}

TEST(ElvBetaReference, BetaQuantilesReachEveryRegion) {
  const auto rows = loadReferenceData("elv_beta_quant.csv", 1);
  ASSERT_GT(rows.size(), 100u);
  double worst = 0.0;
  int counted = 0;
  std::set<long long> methods;
  for (const auto& r : rows) {
    const bool upperForm = r.text[0] == "upper";
    const double p = r.numbers[0], a = r.numbers[1], b = r.numbers[2];
    const double x = r.numbers[3], slope = r.numbers[5];
    double q = -1;
    armed(
        [&] {
          if (upperForm) {
            beta_upper_quant(p, a, b, &q);
          } else {
            beta_lower_quant(p, a, b, &q);
          }
        },
        r.line);
    methods.insert(ELVmethod);
    if (ELVerrno == 1) {
      // A quantile within the smallest argument of 0 or of 1.
      EXPECT_TRUE(q == 0.0 || q == 1.0) << "line " << r.line;
      EXPECT_LT(std::fabs(q - x), 1e-280) << "line " << r.line;
      continue;
    }
    ASSERT_EQ(ELVerrno, 0) << "line " << r.line << " method " << ELVmethod;
    const double e = quantileError(q, x, slope);
    // Cornish-Fisher alone (c above 20000) is an approximation only.
    const bool approximate = ELVmethod == 71 || ELVmethod == 72;
    const double tolerance = approximate ? 1e-3 : kQuantileTolerance;
    EXPECT_LE(e, tolerance) << "line " << r.line << " method " << ELVmethod << ": " << q << " vs "
                            << x;
    if (!approximate) {
      ++counted;
      worst = std::max(worst, e);
    }
  }
  report("beta quantiles (probability)", worst, counted);
  for (long long m :
       {11, 12, 20, 31, 32, 33, 41, 42, 43, 44, 51, 52, 61, 62, 71, 72, 81, 82, 83, 91, 92, 93}) {
    EXPECT_TRUE(methods.count(m)) << "region " << m << " not reached";
  }
}

TEST(ElvBetaReference, FQuantiles) {
  const auto rows = loadReferenceData("elv_F_quant.csv", 1);
  ASSERT_GT(rows.size(), 40u);
  double worst = 0.0;
  int counted = 0;
  for (const auto& r : rows) {
    const bool upperForm = r.text[0] == "upper";
    const double p = r.numbers[0], df1 = r.numbers[1], df2 = r.numbers[2];
    double q = -1;
    armed(
        [&] {
          if (upperForm) {
            F_upper_quant(p, df1, df2, &q);
          } else {
            F_lower_quant(p, df1, df2, &q);
          }
        },
        r.line);
    const double reference = r.numbers[3];
    if (!(reference > 1e-300 && reference < 1e300)) {
      // Beyond the doubles: the beta quantile is 0 or 1 to working precision.
      EXPECT_TRUE(ELVerrno == 1 || ELVerrno == 4) << "line " << r.line << ": " << q;
      continue;
    }
    if (ELVerrno != 0) {
      ADD_FAILURE() << "line " << r.line << " status " << ELVerrno;
      continue;
    }
    const double e = probabilityError(q, reference, r.numbers[4]);
    const double tolerance = (ELVmethod == 71 || ELVmethod == 72) ? 1e-3 : kQuantileTolerance;
    EXPECT_LE(e, tolerance) << "line " << r.line << ": " << q << " vs " << r.numbers[3];
    if (tolerance == kQuantileTolerance) {
      ++counted;
      worst = std::max(worst, e);
    }
  }
  report("F quantiles (probability)", worst, counted);
}

TEST(ElvBetaReference, BinomialQuantilesAndTheirFraction) {
  const auto rows = loadReferenceData("elv_binomial_quant.csv", 1);
  ASSERT_GT(rows.size(), 50u);
  double worst = 0.0;
  int counted = 0;
  for (const auto& r : rows) {
    const bool upperForm = r.text[0] == "upper";
    const double p = r.numbers[0], prob = r.numbers[2];
    const long n = static_cast<long>(r.numbers[1]);
    const long refK = static_cast<long>(r.numbers[3]);
    const double refF = r.numbers[4], mass = r.numbers[5];
    long k = -1;
    double f = -1;
    armed(
        [&] {
          if (upperForm) {
            binomial_upper_quant(n, p, prob, &k, &f);
          } else {
            binomial_lower_quant(n, p, prob, &k, &f);
          }
        },
        r.line);
    if (prob == 0.0 || prob == 1.0) continue;
    ASSERT_EQ(ELVerrno, 0) << "line " << r.line;
    EXPECT_EQ(k, refK) << "line " << r.line;
    // The defining equation P(X < k) + f P(X = k) = p (or its mirror),
    // as an error in p.
    const double e = std::fabs(f - refF) * mass / p;
    EXPECT_LE(e, kQuantileTolerance) << "line " << r.line << ": f " << f << " vs " << refF;
    EXPECT_GE(f, 0.0);
    EXPECT_LT(f, 1.0);
    ++counted;
    worst = std::max(worst, e);
  }
  report("binomial quantile fraction", worst, counted);
}

}  // namespace
