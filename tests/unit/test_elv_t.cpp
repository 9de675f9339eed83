// ELV t routines against mpmath (tools/reference/gen_elv_normal_hyper.py and
// gen_elv_t_noncentral.py): central tails and quantiles for df from 0.002 to
// 1.9e8, noncentral tails for df from 1 to 1e6 and delta from -40 to 40 with
// t of both signs, and the edge cases of the noncentral routine.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdio>
#include <map>
#include <string>

#include "reference_data.h"
#include "utilities/elv/t_internal.h"
#include "utilities/elv/wrappers.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

// Below this a tail is represented as 0 (the routines' underflow limit is
// exp(-662.34472), about 1.6e-288).
constexpr double kZeroTail = 1e-287;
// Relative bound of the status-1 answers outside Owen's paths: the
// saddle-centred integral and a mixture tail flagged for cancellation.
constexpr double kStatusOneBound = 1e-5;

TEST(ElvT, CentralTailsMatchReference) {
  double worst = 0.0;
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
      const double e = relativeError(got, want);
      EXPECT_LT(e, 1e-8) << where << " tail " << i << " got " << got << " want " << want;
      worst = std::max(worst, e);
    }
    // The same through the noncentral routine with delta = 0.
    double nl = -1.0, nu = -1.0;
    ASSERT_FALSE(qel::ElvFailed(qel::elv_t_ncdf(t, df, 0.0, &nl, &nu))) << where;
    EXPECT_EQ(nl, lower) << where;
    EXPECT_EQ(nu, upper) << where;
  }
  std::printf("t_df largest relative error %.3g\n", worst);
}

TEST(ElvT, QuantilesMatchReference) {
  double worst = 0.0;
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
    const double e = relativeError(up, want);
    EXPECT_LT(e, 1e-8) << where << " got " << up << " want " << want;
    EXPECT_EQ(low, -up) << where;
    worst = std::max(worst, e);
  }
  std::printf("t quantile largest relative error %.3g\n", worst);
}


// Largest relative error per method class of t_ncdf.
struct ErrorTable {
  std::map<std::string, double> worst;
  void add(const std::string& key, double e) { worst[key] = std::max(worst[key], e); }
  void print() const {
    for (const auto& kv : worst)
      std::printf("t_ncdf %-36s largest error %.3g\n", kv.first.c_str(), kv.second);
  }
};

std::string methodClass(int64_t method, int status) {
  if (method >= 10000) return "mixture, flagged cancellation";
  if (method == 2 || method == 3 || method < 2000) {
    return status == 0 ? "mixture, status 0 (relative)" : "mixture, status 1 (relative)";
  }
  if (method == 2001) return "saddle integral, df>=1000";
  if (method == 2002 || method == 2003) return "saddle integral fallback";
  if (method == 3000 || method == 3001) return "saddle integral far tail";
  if (method == 4000) return "Owen's T, m = 1";
  if (method == 4001 || method == 4002) return "Owen's recursion";
  if (method == 2000) return "saddle value 0";
  return "other " + std::to_string(method);
}

TEST(ElvT, NoncentralTailsMatchReference) {
  ErrorTable table;
  for (const auto& row : loadReferenceData("elv_t_noncentral.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const std::string where =
        "t=" + std::to_string(t) + " df=" + std::to_string(df) + " delta=" + std::to_string(delta);
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
    const std::string key = methodClass(method, status);
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
      const double e = relativeError(got, want);
      if (fractionalOwen) {
        // The closed form of the integer part on the true df: not the tail
        // of a fractional df (see OwenPathForFractionalDf).
        table.add("Owen, fractional df (relative, no tail)", e);
        continue;
      }
      if (owen) {
        // Terms of both signs: an absolute error.
        EXPECT_LT(std::fabs(got - want), 1e-11) << where << " tail " << i;
        table.add("Owen recursion (absolute error)", std::fabs(got - want));
        continue;
      }
      // Status 0 answers carry the 1e-8 of the mixture sums; the other
      // last-resort paths with status 1 are held to what they reach.
      const double bound = status == qel::ElvNoError ? 1e-8 : kStatusOneBound;
      EXPECT_LT(e, bound) << where << " tail " << i << " method " << method << " got " << got
                          << " want " << want;

      table.add(key, e);
    }
  }
  table.print();
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

}  // namespace
