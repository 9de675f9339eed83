// ELV t routines against mpmath (tools/reference/gen_elv_normal_hyper.py,
// gen_elv_t_noncentral.py, gen_elv_t_saddle.py): central tails and quantiles
// for df from 0.002 to 1.9e8, noncentral tails for df from 1 to 1e6 and delta
// from -40 to 40 with t of both signs; the last-resort methods of the far
// lower tail each on its own (the saddle-centred integral, its closed form
// whose error falls like df^-2, Owen's T and recursion, and the four-term
// expansion in m/(m + t^2) that t_ncdf does not use).
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

TEST(ElvTTailMethods, SaddleIntegralMatchesReference) {
  double worst = 0.0;
  int checked = 0;
  for (const auto& row : loadReferenceData("elv_t_noncentral.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    if (!(t < 0.0 && delta > 0.0)) continue;
    const double want = row.numbers[3];
    const double got = qel::elv::t_saddle_integral(t, df, delta);
    const std::string where = ::where(t, df, delta);
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
    const std::string where = ::where(t, df, delta);
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

// The expansion stops at order 1/df, so its relative error falls like
// df^-2: measured 2.9e-4 at df = 10, 3.6e-6 at 100, 2.1e-8 at 1000,
// 1.7e-10 at 1e4, 1.6e-12 at 1e5, down to rounding (about 1e-13) above.
double formulaBound(double df) {
  return std::max(5e-2 / (df * df), 2e-13);
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

// Each row holds the tail, the exact value of the four-term expansion as the
// kernel forms it, and the condition number of its sum of products (sum of
// magnitudes over magnitude of the sum). The kernel must reproduce the
// expansion to the accuracy of its inputs (the central t tail and the normal
// tail, each good to about 1e-10 relative) times that condition number; its
// error against the tail is then the truncation error plus that.
constexpr double kInputAccuracy = 2e-10;

double faithfulBound(double condition) {
  return kInputAccuracy * condition + 1e-13;
}

TEST(ElvTExpansion, MatchesReferenceWithinTruncationAndCancellation) {
  // Largest error against the tail per m over delta in [-5, 3], (3, 5],
  // (5, 10], above 10.
  std::map<int, double> worst[4];
  int checked = 0;
  for (const auto& row : loadReferenceData("elv_t_expansion.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    const double tail = row.numbers[3], expansion = row.numbers[4], condition = row.numbers[5];
    const int m = static_cast<int>(df);
    if (df != m) continue;  // fractional df: see FractionalDfKeepsIntegerPartExpansion
    ELVerrno = 0;
    const double got = t_expansion_approx(t, df, delta);
    ASSERT_EQ(ELVerrno, 0) << where(t, df, delta);
    EXPECT_LT(relativeError(got, expansion), faithfulBound(condition))
        << where(t, df, delta) << " got " << got << " expansion " << expansion;
    const double e = relativeError(got, tail);
    EXPECT_LT(e, relativeError(expansion, tail) + faithfulBound(condition))
        << where(t, df, delta) << " got " << got << " tail " << tail;
    const int band = delta <= 3.0 ? 0 : delta <= 5.0 ? 1 : delta <= 10.0 ? 2 : 3;
    worst[band][m] = std::max(worst[band][m], e);
    ++checked;
  }
  EXPECT_GT(checked, 500);
  std::printf("t_expansion_approx largest relative error per m (t in the 3000/3001 regions)\n");
  std::printf("   m  delta<=3   3<d<=5    5<d<=10   10<d<=21.3\n");
  for (int m = 1; m <= 12; ++m) {
    std::printf("  %2d  %.2e  %.2e  %.2e  %.2e\n", m, worst[0][m], worst[1][m], worst[2][m],
                worst[3][m]);
  }
}

TEST(ElvTExpansion, FractionalDfKeepsIntegerPartExpansion) {
  // For a fractional df the table, B and c of the integer part m meet the
  // central tail of the true df in A(0): the kernel must still form that
  // expansion, which is not the tail of either df. Measured error printed.
  double worst = 0.0;
  int checked = 0;
  for (const auto& row : loadReferenceData("elv_t_expansion.csv", 0)) {
    const double t = row.numbers[0], df = row.numbers[1], delta = row.numbers[2];
    if (df == std::floor(df)) continue;
    const double got = t_expansion_approx(t, df, delta);
    EXPECT_LT(relativeError(got, row.numbers[4]), faithfulBound(row.numbers[5]))
        << where(t, df, delta) << " got " << got << " expansion " << row.numbers[4];
    worst = std::max(worst, relativeError(got, row.numbers[3]));
    ++checked;
  }
  EXPECT_GT(checked, 50);
  std::printf("t_expansion_approx, fractional df: largest relative error %.3g\n", worst);
}

TEST(ElvTExpansion, NoncentralTFarTailKeepsTheSaddleIntegral) {
  // Every reference point on the opposite-sign side with df 2..12 and delta
  // up to 21.3 goes through t_ncdf. Where it lands on method 3000 or 3001
  // the answer is the saddle integral, which must stay far more accurate
  // than the expansion it is preferred to (their errors are printed side by
  // side), with status 1 and the region of its m.
  int seen[2] = {0, 0};
  std::map<double, std::pair<double, double>> errors;
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
    auto& e = errors[df];
    e.first = std::max(e.first, relativeError(lower, row.numbers[3]));
    e.second = std::max(e.second, relativeError(t_expansion_approx(t, df, delta), row.numbers[3]));
    // Mirrored arguments give the exchanged tails.
    double l2 = 0.0, u2 = 0.0;
    qel::elv_t_ncdf(-t, df, -delta, &l2, &u2);
    EXPECT_EQ(u2, lower) << where(t, df, delta);
  }
  for (const auto& kv : errors) {
    std::printf("t_ncdf methods 3000/3001, df %4.1f: largest error %.2e (expansion %.2e)\n",
                kv.first, kv.second.first, kv.second.second);
  }
  EXPECT_GT(seen[0], 10);
  EXPECT_GT(seen[1], 10);
}

}  // namespace
