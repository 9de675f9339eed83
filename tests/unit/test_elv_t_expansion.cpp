// The far-tail expansion of the noncentral t lower tail in m/(m + t^2)
// against the mpmath tail (tests/data/elv_t_expansion.csv), its guards, and
// why t_ncdf (methods 3000 and 3001) keeps the saddle integral instead.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdio>
#include <limits>
#include <map>
#include <string>

#include "reference_data.h"
#include "utilities/elv/wrappers.h"

namespace {

using qeltest::loadReferenceData;
using qeltest::relativeError;

std::string where(double t, double df, double delta) {
  return "t=" + std::to_string(t) + " df=" + std::to_string(df) + " delta=" + std::to_string(delta);
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
