// ELV t routines against mpmath (tools/reference/gen_elv_normal_hyper.py,
// gen_elv_t_noncentral.py, gen_elv_t_saddle.py): central tails and quantiles
// for df from 0.002 to 1.9e8, noncentral tails for df from 1 to 1e6 and delta
// from -40 to 40 with t of both signs; the last-resort methods of the far
// lower tail each on its own (the saddle-centred integral, its closed form,
// Owen's T and recursion, and the four-term expansion in m/(m + t^2)).
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <string>

#include "reference_data.h"
#include "utilities/elv/t_internal.h"
#include "utilities/elv/wrappers.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

std::string where(double t, double df, double delta) {
  return "t=" + std::to_string(t) + " df=" + std::to_string(df) + " delta=" + std::to_string(delta);
}

// Below this a tail is represented as 0 (the routines' underflow limit is
// exp(-662.34472), about 1.6e-288).
constexpr double kZeroTail = 1e-287;
// Relative bound of the status-1 answers outside Owen's paths: the
// saddle-centred integral and a mixture tail flagged for cancellation.
constexpr double kStatusOneBound = 1e-5;

TEST(ElvT, CentralTailsMatchReference) {
  for (const auto& row : loadReferenceData("elv_t_central.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1];
    double lower = -1.0, upper = -1.0;
    const qel::ElvStatus status = qel::elv_t_df(t, df, &lower, &upper);
    const std::string where = "t=" + std::to_string(t) + " df=" + std::to_string(df);
    if (df > 189812530.0) {
      EXPECT_EQ(status, qel::ElvArgumentOutOfRange) << where;
      continue;
    }
    ASSERT_FALSE(qel::ElvFailed(status)) << where;
    if (std::fabs(t) > 1.0 / 1.4916681462400413e-144) {
      // Beyond this |t| both routines answer 0 and 1 outright; for df below
      // 2 the true tail there is still representable (0.25 for df = 0.002).
      EXPECT_EQ(t < 0.0 ? lower : upper, 0.0) << where;
      EXPECT_EQ(t < 0.0 ? upper : lower, 1.0) << where;
      continue;
    }
    for (int i = 0; i < 2; ++i) {
      const double got = i == 0 ? lower : upper, want = row.numbers[2 + i];
      if (want < kZeroTail) {
        EXPECT_LT(got, 1e-280) << where;
        continue;
      }
      EXPECT_LT(relativeError(got, want), 1e-8) << where << " tail " << i << " got " << got;
    }
    // The same through the noncentral routine with delta = 0.
    double nl = -1.0, nu = -1.0;
    ASSERT_FALSE(qel::ElvFailed(qel::elv_t_ncdf(t, df, 0.0, &nl, &nu))) << where;
    EXPECT_EQ(nl, lower) << where;
    EXPECT_EQ(nu, upper) << where;
  }
}

TEST(ElvT, QuantilesMatchReference) {
  for (const auto& row : loadReferenceData("elv_t_quantiles.csv", 0)) {
    const double p = row.numbers[0], df = row.numbers[1], want = row.numbers[2];
    const std::string where = "p=" + std::to_string(p) + " df=" + std::to_string(df);
    double up = 0.0, low = 0.0;
    if (df > 189812530.0) {
      EXPECT_EQ(qel::elv_t_upper_quant(p, df, &up), qel::ElvArgumentOutOfRange) << where;
      continue;
    }
    if (df / (df + want * want) < 2.2250738585072014e-288) {
      // The beta quantile df/(df + q^2) is below the smallest argument the
      // beta routines take: status 4.
      EXPECT_EQ(qel::elv_t_upper_quant(p, df, &up), qel::ElvInternalFailure) << where;
      continue;
    }
    ASSERT_FALSE(qel::ElvFailed(qel::elv_t_upper_quant(p, df, &up))) << where;
    ASSERT_FALSE(qel::ElvFailed(qel::elv_t_lower_quant(p, df, &low))) << where;
    if (want == 0.0) {
      EXPECT_EQ(up, 0.0) << where;
      continue;
    }
    EXPECT_LT(relativeError(up, want), 1e-8) << where << " got " << up << " want " << want;
    EXPECT_EQ(low, -up) << where;
  }
}

TEST(ElvT, NoncentralTailsMatchReference) {
  for (const auto& row : loadReferenceData("elv_t_noncentral.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const std::string where = ::where(t, df, delta);
    double lower = -3.0, upper = -3.0;
    const qel::ElvStatus status = qel::elv_t_ncdf(t, df, delta, &lower, &upper);
    ASSERT_FALSE(qel::ElvFailed(status)) << where;
    const int64_t method = ELVmethod;
    if (t * delta < 0.0 && std::fabs(delta) > 21.3) {
      // The tail on the far side of zero is set to 0 (it is below 1e-100).
      EXPECT_EQ(method, 1) << where;
      EXPECT_EQ(delta > 0.0 ? lower : upper, 0.0) << where;
      EXPECT_LT(delta > 0.0 ? row.numbers[3] : row.numbers[4], 1e-100) << where;
      continue;
    }
    const bool owen = method >= 4000 && method <= 4002;
    const bool fractionalOwen = owen && df != std::floor(df);
    if (owen) {
      EXPECT_EQ(status, qel::ElvLossOfSignificance) << where;
    }
    for (int i = 0; i < 2; ++i) {
      const double got = i == 0 ? lower : upper, want = row.numbers[3 + i];
      if (want < 1e-280) {
        // Status 1 with 0 where the peak term of a sum underflowed.
        EXPECT_LT(got, 1e-280) << where << " tail " << i;
        continue;
      }
      // The closed form of the integer part on a fractional df is not its
      // tail (see OwenPathForFractionalDf).
      if (fractionalOwen) continue;
      if (owen) {
        // Terms of both signs: an absolute error.
        EXPECT_LT(std::fabs(got - want), 1e-11) << where << " tail " << i;
        continue;
      }
      // Status 0 answers carry the 1e-8 of the mixture sums; the other
      // last-resort paths with status 1 are held to what they reach.
      const double bound = status == qel::ElvNoError ? 1e-8 : kStatusOneBound;
      EXPECT_LT(relativeError(got, want), bound)
          << where << " tail " << i << " method " << method << " got " << got;
    }
  }
}

TEST(ElvT, OwenPathForFractionalDf) {
  // df = 1.5 where the mixture's lower tail does not stand: m = 1, and the
  // closed form 2 Tha_c(delta sqrt(df/(df+t^2)), -t/sqrt(df)) of df = 1 is
  // taken on the true df, with status 1 and method 4000.
  bool seen = false;
  for (const auto& row : loadReferenceData("elv_t_noncentral.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    if (df != 1.5 || t >= 0.0 || delta <= 0.0 || delta > 21.3) continue;
    double lower, upper;
    const qel::ElvStatus status = qel::elv_t_ncdf(t, df, delta, &lower, &upper);
    if (ELVmethod != 4000) continue;
    seen = true;
    EXPECT_EQ(status, qel::ElvLossOfSignificance);
    double owen = 0.0;
    ASSERT_EQ(Tha_c(&owen, delta * std::sqrt(df / (df + t * t)), -t / std::sqrt(df)), 0);
    EXPECT_EQ(lower, 2.0 * owen) << "t=" << t << " delta=" << delta;
    EXPECT_EQ(upper, 1.0 - lower);
  }
  EXPECT_TRUE(seen);
}

// The saddle-centred integral, which t_ncdf uses below df = 1e5, against the
// noncentral rows and the saddle rows: 1e-13 where the closed form is still at
// 1e-4; at df = 1e6 and above its panels lose digits (up to 1e-11).
TEST(ElvTTailMethods, SaddleIntegralMatchesReference) {
  int checked = 0;
  for (const char* file : {"elv_t_noncentral.csv", "elv_t_saddle.csv"}) {
    for (const auto& row : loadReferenceData(file, 0)) {
      const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
      const double want = row.numbers[3];
      if (!(t < 0.0 && delta > 0.0) || df > 1e6) continue;
      const double got = qel::elv::t_saddle_integral(t, df, delta);
      if (want < 1e-287) {
        EXPECT_LT(got, 1e-280) << where(t, df, delta);
        continue;
      }
      EXPECT_LT(relativeError(got, want), df < 1e5 ? 3e-13 : 2e-11) << where(t, df, delta);
      ++checked;
    }
  }
  EXPECT_GT(checked, 150);
}

// The recursion adds terms of both signs of the size of phi(delta s), far
// above a tail below 1e-20: its error is absolute, below 1e-11. Owen's T
// alone (m = 1) is exact for df = 1 only.
TEST(ElvTTailMethods, OwenRecursionMatchesReference) {
  int checked = 0;
  for (const auto& row : loadReferenceData("elv_t_noncentral.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const long m = static_cast<long>(df);
    if (!(t < 0.0 && delta > 0.0 && delta <= 21.3) || m > 12 || (m == 1 && df != 1.0)) continue;
    if (!(m == 1 || (m <= 6 && t > -10.0) || (m >= 7 && t > -2.0))) continue;
    const double want = row.numbers[3];
    double got = -2.0;
    ASSERT_EQ(qel::elv::owenLowerTail(t, df, delta, &got), 0);
    const double e = relativeError(got, want);
    EXPECT_LT(m == 1 ? e : std::fabs(got - want), m == 1 ? 1e-10 : 1e-11) << where(t, df, delta);
    if (want > 1e-12) {
      EXPECT_LT(e, 1e-6) << where(t, df, delta);
    }
    ++checked;
  }
  EXPECT_GT(checked, 10);
}

// The closed saddle form stops at order 1/df, so its relative error falls
// like df^-2: measured 2.9e-4 at df = 10, 3.6e-6 at 100, 1.6e-12 at 1e5, down
// to rounding (about 1e-13) above. Below e^-662.34472 the tail is cut to 0.
TEST(ElvTSaddle, ErrorFallsLikeInverseSquareOfDf) {
  int checked = 0, cut = 0;
  for (const auto& row : loadReferenceData("elv_t_saddle.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const double want = row.numbers[3], got = t_saddle_approx(t, df, delta);
    if (want < 1e-287) {
      EXPECT_LT(got, 1e-280) << where(t, df, delta);
      ++cut;
      continue;
    }
    EXPECT_LT(relativeError(got, want), std::max(5e-2 / (df * df), 2e-13)) << where(t, df, delta);
    ++checked;
  }
  EXPECT_GT(checked, 100);
  EXPECT_GT(cut, 10);
}

// Each row holds the tail, the exact value of the four-term expansion as the
// kernel forms it, and the condition number of its sum of products. The
// kernel must reproduce the expansion to the accuracy of its inputs (central
// t and normal tails, about 1e-10 relative) times that condition number; its
// error against the tail is then the truncation error plus that. For a
// fractional df the table, B and c of the integer part meet the central tail
// of the true df: the kernel must still form that expansion, which is not
// the tail of either df.
TEST(ElvTExpansion, MatchesReferenceWithinTruncationAndCancellation) {
  int checked = 0;
  for (const auto& row : loadReferenceData("elv_t_expansion.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const double tail = row.numbers[3], expansion = row.numbers[4];
    const double bound = 2e-10 * row.numbers[5] + 1e-13;
    ELVerrno = 0;
    const double got = t_expansion_approx(t, df, delta);
    ASSERT_EQ(ELVerrno, 0) << where(t, df, delta);
    EXPECT_LT(relativeError(got, expansion), bound) << where(t, df, delta) << " got " << got;
    if (df == std::floor(df)) {
      EXPECT_LT(relativeError(got, tail), relativeError(expansion, tail) + bound)
          << where(t, df, delta) << " got " << got << " tail " << tail;
    }
    ++checked;
  }
  EXPECT_GT(checked, 550);
}

// Every opposite-sign reference point with df 2..12 goes through t_ncdf;
// where it lands on method 3000 or 3001 the answer is the saddle integral,
// far more accurate than the expansion, with status 1 and the region of m.
TEST(ElvTExpansion, NoncentralTFarTailKeepsTheSaddleIntegral) {
  int seen[2] = {0, 0};
  for (const auto& row : loadReferenceData("elv_t_expansion.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const int m = static_cast<int>(df);
    if (m < 2 || delta <= 0.0) continue;
    double lower = -3.0, upper = -3.0;
    const qel::ElvStatus status = qel::elv_t_ncdf(t, df, delta, &lower, &upper);
    const int64_t method = ELVmethod;
    if (method != 3000 && method != 3001) continue;
    ++seen[method - 3000];
    EXPECT_EQ(method, m <= 6 ? 3000 : 3001) << where(t, df, delta);
    EXPECT_TRUE(m <= 6 ? t <= -10.0 : t < -25.0) << where(t, df, delta);
    EXPECT_EQ(status, qel::ElvLossOfSignificance) << where(t, df, delta);
    EXPECT_LT(relativeError(lower, row.numbers[3]), 1e-12) << where(t, df, delta);
    EXPECT_EQ(upper, 1.0 - lower) << where(t, df, delta);
    // Mirrored arguments give the exchanged tails.
    double l2 = 0.0, u2 = 0.0;
    qel::elv_t_ncdf(-t, df, -delta, &l2, &u2);
    EXPECT_EQ(u2, lower) << where(t, df, delta);
  }
  EXPECT_GT(seen[0], 10);
  EXPECT_GT(seen[1], 10);
}

}  // namespace
