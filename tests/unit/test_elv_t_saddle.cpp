// The closed saddle-point form t_saddle_approx of the far lower tail of the
// noncentral t against the mpmath tails of elv_t_saddle.csv (t < 0 < delta,
// df from 10 to 1e8, and the edges delta = 0 and t >= 0 where the boundary
// still lies beyond the mode), and its guards.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <limits>
#include <map>
#include <string>

#include "reference_data.h"
#include "utilities/elv/t_internal.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

// The expansion stops at order 1/df, so its relative error falls like
// df^-2: measured 2.9e-4 at df = 10, 3.6e-6 at 100, 2.1e-8 at 1000,
// 1.7e-10 at 1e4, 1.6e-12 at 1e5, down to rounding (about 1e-13) above.
double formulaBound(double df) {
  return std::max(5e-2 / (df * df), 2e-13);
}

std::string where(double t, double df, double delta) {
  return "t=" + std::to_string(t) + " df=" + std::to_string(df) + " delta=" + std::to_string(delta);
}

TEST(ElvTSaddle, ErrorFallsLikeInverseSquareOfDf) {
  std::map<double, double> worst;
  int checked = 0, cut = 0;
  for (const auto& row : loadReferenceData("elv_t_saddle.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const double want = row.numbers[3];
    const double got = t_saddle_approx(t, df, delta);
    if (want < 1e-287) {
      // Below e^-662.34472 the tail is cut to 0.
      EXPECT_LT(got, 1e-280) << where(t, df, delta);
      ++cut;
      continue;
    }
    const double e = relativeError(got, want);
    EXPECT_LT(e, formulaBound(df)) << where(t, df, delta) << " got " << got << " want " << want;
    worst[df] = std::max(worst[df], e);
    ++checked;
  }
  EXPECT_GT(checked, 100);
  EXPECT_GT(cut, 10);
  for (const auto& [df, e] : worst) std::printf("df %-8g largest relative error %.3g\n", df, e);
}

TEST(ElvTSaddle, IntegralIsTheAccurateForm) {
  // The saddle-centred integral, which t_ncdf uses below df = 1e5, stays at
  // 1e-13 over the same points where the closed form is still at 1e-4; at
  // df = 1e6 and above the integral's panels lose digits (up to 1e-11) and
  // the closed form is the better of the two.
  for (const auto& row : loadReferenceData("elv_t_saddle.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const double want = row.numbers[3];
    if (!(t < 0.0 && delta > 0.0) || want < 1e-287 || df > 1e6) continue;
    const double bound = df < 1e5 ? 3e-13 : 2e-11;
    EXPECT_LT(relativeError(qel::elv::t_saddle_integral(t, df, delta), want), bound)
        << where(t, df, delta);
  }
}


}  // namespace
