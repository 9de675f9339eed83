// The incomplete beta ratio (ACM TOMS 708) against mpmath: every branch of
// the driver reached, both tails, the error codes and the degenerate cases.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <map>
#include <string>

#include "reference_data.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/higher_functions/incomplete_beta.h"
#include "utilities/higher_functions/transcendental.h"

namespace {

// Relative error at most 1e-13, plus what one rounding of x or y (or of the
// products (a + b) x that the algorithm forms) costs through the condition
// number of the tail: about 1e-13 more at a = b = 1e5.
constexpr double kTolerance = 1e-13;
constexpr double kRounding = 2.3e-16;

struct BratioResult {
  double w = -1.0, w1 = -1.0;
  int ierr = -1;
};

BratioResult bratio(double a, double b, double x, double y) {
  BratioResult r;
  qel::BRATIO(a, b, x, y, &r.w, &r.w1, &r.ierr);
  return r;
}

TEST(IncompleteBetaRatio, EveryBranchMatchesHighPrecisionValues) {
  const auto rows = qeltest::loadReferenceData("incomplete_beta.csv", 1);
  std::map<std::string, double> worst;
  std::map<std::string, int> count;
  for (const auto& row : rows) {
    const std::string& branch = row.text[0];
    const double a = row.numbers[0], b = row.numbers[1], x = row.numbers[2], y = row.numbers[3];
    const double lower = row.numbers[4], upper = row.numbers[5];
    const BratioResult r = bratio(a, b, x, y);
    ASSERT_EQ(r.ierr, 0) << "line " << row.line;
    const double tol1 = kTolerance + kRounding * row.numbers[6];
    const double tol2 = kTolerance + kRounding * row.numbers[7];
    const double e1 = qeltest::relativeError(r.w, lower);
    const double e2 = qeltest::relativeError(r.w1, upper);
    worst[branch] = std::max(worst[branch], std::max(e1, e2));
    ++count[branch];
    EXPECT_LE(e1, tol1) << branch << " I_x(" << a << ", " << b << ") x=" << x << " line "
                        << row.line << " got " << r.w << " want " << lower;
    EXPECT_LE(e2, tol2) << branch << " complement (" << a << ", " << b << ") x=" << x << " line "
                        << row.line << " got " << r.w1 << " want " << upper;
  }
  for (const char* branch : {"fpser", "apser", "bpser", "bpser_complement", "bup_bgrat", "bgrat",
                             "bup_bpser", "bup_bgrat_large", "bfrac", "basym"}) {
    EXPECT_GE(count[branch], 20) << "too few points reach " << branch;
  }
  for (const auto& [branch, error] : worst) {
    std::printf("  %-18s %5d points, max relative error %.2e\n", branch.c_str(), count[branch],
                error);
  }
}

// The ratio remembers shape-only factors of the last shapes per thread: each
// point right after its neighbour's shapes, and again with the shapes in the
// other order (I_x(a, b) = 1 - I_y(b, a)), still matches mpmath.
TEST(IncompleteBetaRatio, RememberedShapeFactorsFollowTheShapes) {
  const auto rows = qeltest::loadReferenceData("incomplete_beta.csv", 1);
  for (std::size_t i = 1; i < rows.size(); ++i) {
    const auto& v = rows[i].numbers;
    const auto& prev = rows[i - 1].numbers;
    bratio(prev[0], prev[1], prev[2], prev[3]);
    const BratioResult r = bratio(v[0], v[1], v[2], v[3]);
    const BratioResult swapped = bratio(v[1], v[0], v[3], v[2]);
    const double tol1 = kTolerance + kRounding * v[6], tol2 = kTolerance + kRounding * v[7];
    EXPECT_LE(qeltest::relativeError(r.w, v[4]), tol1) << "line " << rows[i].line;
    EXPECT_LE(qeltest::relativeError(swapped.w1, v[4]), tol1) << "line " << rows[i].line;
    EXPECT_LE(qeltest::relativeError(swapped.w, v[5]), tol2) << "line " << rows[i].line;
  }
}

TEST(IncompleteBetaRatio, ThinWrapperPicksTailAndDropsErrors) {
  const BratioResult r = bratio(2.0, 3.0, 0.3, 0.7);
  EXPECT_EQ(qel::mIncompleteBetaRatio(0.3, 0.7, 2.0, 3.0, false), r.w);
  EXPECT_EQ(qel::mIncompleteBetaRatio(0.3, 0.7, 2.0, 3.0, true), r.w1);
  // I_0.5(a, a) = 1/2 by symmetry, in both tails.
  EXPECT_NEAR(qel::mIncompleteBetaRatio(0.5, 0.5, 7.0, 7.0, true), 0.5, 1e-15);
  EXPECT_EQ(qel::mIncompleteBetaRatio(0.5, 0.5, -1.0, 2.0, false), 0.0);
  EXPECT_EQ(qel::mIncompleteBetaRatio(0.5, 0.5, -1.0, 2.0, true), 0.0);
  EXPECT_EQ(qel::mIncompleteBetaRatio(1.5, -0.5, 1.0, 2.0, false), 0.0);
}

TEST(IncompleteBetaRatio, ErrorCodesInTheirOrder) {
  const struct {
    double a, b, x, y;
    int ierr;
  } cases[] = {
      {-1.0, 2.0, 0.5, 0.5, 1}, {1.0, -1e-300, 0.5, 0.5, 1},     {0.0, 0.0, 0.5, 0.5, 2},
      {1.0, 1.0, -0.1, 1.1, 3}, {1.0, 1.0, 1.5, -0.5, 3},        {1.0, 1.0, 0.5, 1.5, 4},
      {1.0, 1.0, 0.5, -0.5, 4}, {1.0, 1.0, 0.5, 0.5 + 1e-14, 5}, {0.0, 1.0, 0.0, 1.0, 6},
      {1.0, 0.0, 1.0, 0.0, 7},  {-1.0, 0.0, 2.0, 0.5, 1},
  };
  for (const auto& c : cases) {
    const BratioResult r = bratio(c.a, c.b, c.x, c.y);
    EXPECT_EQ(r.ierr, c.ierr) << c.a << " " << c.b << " " << c.x << " " << c.y;
    EXPECT_EQ(r.w, 0.0);
    EXPECT_EQ(r.w1, 0.0);
  }
  // x + y = 1 + 1e-14 is refused, not answered.
  EXPECT_EQ(bratio(2.0, 3.0, 0.25, 0.75 + 1e-14).ierr, 5);
  // Within 3 eps the pair is accepted.
  EXPECT_EQ(bratio(2.0, 3.0, 0.25, std::nextafter(0.75, 1.0)).ierr, 0);
}

// x at 0 or 1; a = 0 puts all mass at 0, b = 0 at 1; both parameters below
// 1e-3 eps give b/(a+b) whatever x is.
TEST(IncompleteBetaRatio, DegenerateArguments) {
  const struct {
    double a, b, x, w;
  } cases[] = {{2.0, 3.0, 0.0, 0.0},     {2.0, 3.0, 1.0, 1.0},       {0.0, 3.0, 0.4, 1.0},
               {3.0, 0.0, 0.4, 0.0},     {1e-20, 1e-20, 1e-10, 0.5}, {1e-20, 1e-20, 0.3, 0.5},
               {1e-20, 1e-20, 0.9, 0.5}, {1e-20, 3e-20, 0.3, 0.75}};
  for (const auto& c : cases) {
    const BratioResult r = bratio(c.a, c.b, c.x, 1.0 - c.x);
    EXPECT_EQ(r.ierr, 0);
    EXPECT_DOUBLE_EQ(r.w, c.w) << c.a << " " << c.b << " " << c.x;
    EXPECT_DOUBLE_EQ(r.w1, 1.0 - c.w) << c.a << " " << c.b << " " << c.x;
  }
}

TEST(IncompleteBetaRatio, NamedEdgeCases) {
  // fpser after the exchange on x above 0.5: with b = 1e-17, 1/Beta(a, b) is
  // b, so I_0.7(0.5, b) = b times the integral of t^(-1/2)/(1-t) from 0 to
  // 0.7, which is 2 artanh(sqrt 0.7).
  BratioResult r = bratio(0.5, 1e-17, 0.7, 0.3);
  EXPECT_EQ(r.ierr, 0);
  EXPECT_NEAR(r.w / (1e-17 * 2.0 * std::atanh(std::sqrt(0.7))), 1.0, 1e-13);
  EXPECT_EQ(r.w1, 0.5 + (0.5 - r.w));
  // lambda = 0 in basym: I_0.5(1000, 1000) = 1/2.
  r = bratio(1000.0, 1000.0, 0.5, 0.5);
  EXPECT_NEAR(r.w, 0.5, 1e-14);
  EXPECT_NEAR(r.w1, 0.5, 1e-14);
}

TEST(IncompleteBetaRatio, HelpersAgainstClosedForms) {
  // bup: I_x(a, b) - I_x(a+n, b) with b = 1, where I_x(a, 1) = x^a.
  const double x = 0.6;
  EXPECT_NEAR(qel::bup(2.0, 1.0, x, 1 - x, 3, 1e-15), std::pow(x, 2) - std::pow(x, 5), 1e-15);
  // esum never overflows in between: exp(700 + 50 - 60).
  EXPECT_NEAR(qel::esum(700, -650.0) / std::exp(50.0), 1.0, 1e-14);
  EXPECT_NEAR(qel::esum(-700, 710.0) / std::exp(10.0), 1.0, 1e-13);
  EXPECT_EQ(qel::esum(-708, -100.0), 0.0);
  // brcomp at a = b = 1: x y / Beta(1, 1) = x y.
  EXPECT_NEAR(qel::brcomp(1.0, 1.0, 0.25, 0.75), 0.1875, 1e-16);
  EXPECT_NEAR(qel::brcmp1(5, 1.0, 1.0, 0.25, 0.75), 0.1875 * std::exp(5.0), 1e-13);
}

TEST(IncompleteBetaRatio, ArmedFrameDoesNotTrap) {
  const auto rows = qeltest::loadReferenceData("incomplete_beta.csv", 1);
  qel::SetLynFpuStates();
  int checked = 0;
  for (const auto& row : rows) {
    double w, w1;
    int ierr;
    qel::BRATIO(row.numbers[0], row.numbers[1], row.numbers[2], row.numbers[3], &w, &w1, &ierr);
    checked += (ierr == 0);
  }
  qel::ResetFpuStates();
  EXPECT_EQ(checked, static_cast<int>(rows.size()));
}

}  // namespace
