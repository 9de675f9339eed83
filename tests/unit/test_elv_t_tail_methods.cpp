// The last-resort methods of the noncentral t lower tail at t < 0 < delta,
// each against the mpmath reference on its own: the saddle-centred
// integral (every df) and Owen's T and recursion (small integer parts of df).
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <string>

#include "reference_data.h"
#include "utilities/elv/t_internal.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

TEST(ElvTTailMethods, SaddleIntegralMatchesReference) {
  double worst = 0.0;
  int checked = 0;
  for (const auto& row : loadReferenceData("elv_t_noncentral.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    if (!(t < 0.0 && delta > 0.0)) continue;
    const double want = row.numbers[3];
    const double got = qel::elv::t_saddle_integral(t, df, delta);
    const std::string where =
        "t=" + std::to_string(t) + " df=" + std::to_string(df) + " delta=" + std::to_string(delta);
    if (want < 1e-287) {
      EXPECT_LT(got, 1e-280) << where;
      continue;
    }
    const double e = relativeError(got, want);
    EXPECT_LT(e, 1e-10) << where << " got " << got << " want " << want;
    worst = std::max(worst, e);
    ++checked;
  }
  EXPECT_GT(checked, 50);
  std::printf("t_saddle_integral largest relative error %.3g over %d points\n", worst, checked);
}

TEST(ElvTTailMethods, OwenRecursionMatchesReference) {
  // The recursion adds terms of both signs of the size of phi(delta s),
  // far above a tail below 1e-20, with normal tails of relative accuracy
  // 1e-9 (normal_df): its error is absolute, below 1e-11, and the relative
  // error of a tiny tail can reach 100%.
  // Owen's T alone (m = 1) is exact for df = 1 only; a fractional df with
  // m = 1 takes the closed form of df = 1 on the true df, which is not the
  // tail of that df and is not checked here.
  double worst = 0.0, worstAbsolute = 0.0;
  int checked = 0;
  for (const auto& row : loadReferenceData("elv_t_noncentral.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const long m = static_cast<long>(df);
    if (!(t < 0.0 && delta > 0.0 && delta <= 21.3) || m > 12) continue;
    if (m == 1 && df != 1.0) continue;
    const bool used = m == 1 || (m <= 6 && t > -10.0) || (m >= 7 && t > -2.0);
    if (!used) continue;
    const double want = row.numbers[3];
    double got = -2.0;
    ASSERT_EQ(qel::elv::owenLowerTail(t, df, delta, &got), 0);
    const std::string where =
        "t=" + std::to_string(t) + " df=" + std::to_string(df) + " delta=" + std::to_string(delta);
    const double e = relativeError(got, want);
    if (m == 1) {
      EXPECT_LT(e, 1e-10) << where << " got " << got << " want " << want;
    } else {
      EXPECT_LT(std::fabs(got - want), 1e-11) << where << " got " << got << " want " << want;
      if (want > 1e-12) {
        EXPECT_LT(e, 1e-6) << where;
        worst = std::max(worst, e);
      }
      worstAbsolute = std::max(worstAbsolute, std::fabs(got - want));
    }
    ++checked;
  }
  EXPECT_GT(checked, 10);
  std::printf(
      "Owen's recursion over %d points: largest relative error %.3g where the tail "
      "exceeds 1e-12, largest absolute error %.3g\n",
      checked, worst, worstAbsolute);
}

}  // namespace
