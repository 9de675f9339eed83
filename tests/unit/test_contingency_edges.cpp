// The contingency table object on hand-worked edge tables, on bad input and
// around its lifecycle: which buffers Analyze writes, the marks of the
// impossible cases, threads, strata, and the calls a careless host makes.
#include <gtest/gtest.h>
#include <omp.h>

#include <cmath>
#include <limits>
#include <random>
#include <vector>

#include "basic_statistics/ContingencyTable.h"
#include "contingency_run.h"

namespace {

using qeltest::kAllTableResults;
using qeltest::kSentinel;
using qeltest::TableHost;

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

bool allNaN(double const* x, int n) {
  for (int i = 0; i < n; ++i) {
    if (!std::isnan(x[i])) return false;
  }
  return true;
}

// Which entries of every buffer still hold the sentinel.
std::vector<bool> untouched(TableHost const& host) {
  std::vector<bool> marks;
  for (double x : host.everything()) marks.push_back(x == kSentinel);
  return marks;
}

TEST(ContingencyEdges, OnlyRequestedResultsAreWritten) {
  std::mt19937 rng(7);
  std::uniform_int_distribution<int> count(0, 9);
  std::vector<double> table(4 * 3);
  for (double& x : table) x = count(rng) + 1;
  // The whole run, to know which entries a bit writes.
  TableHost full(4, 3, table);
  full.run(kAllTableResults);
  const std::vector<double> all = full.everything();
  for (unsigned bit = 1; bit <= 0x800000; bit <<= 1) {
    TableHost host(4, 3, table);
    // Every buffer is lent (the MHC buffer only with its bit, since its
    // Setup zeroes it): the column-wise Setup calls outside the mask are
    // ignored.
    host.run(bit, true);
    ASSERT_EQ(host.code, 0) << std::hex << bit;
    TableHost reference(4, 3, table);
    reference.run(0, true);
    const std::vector<bool> before = untouched(reference);
    const std::vector<bool> after = untouched(host);
    const std::vector<double> got = host.everything();
    int written = 0;
    for (std::size_t i = 0; i < got.size(); ++i) {
      ASSERT_TRUE(before[i]);
      if (after[i]) continue;
      ++written;
      // A written entry holds what the full run holds there.
      EXPECT_TRUE(got[i] == all[i] || (std::isnan(got[i]) && std::isnan(all[i])))
          << std::hex << bit << std::dec << " entry " << i;
    }
    EXPECT_GT(written, 0) << std::hex << bit;
    // No bit writes more than its own buffer: at most one column-wise
    // result of 12 values, or 9 values of a record.
    EXPECT_LE(written, 12) << std::hex << bit;
  }
}

TEST(ContingencyEdges, PearsonAloneUsesTemporaryExpectedCounts) {
  TableHost host(3, 2, {20, 15, 30, 25, 10, 8});
  host.run(0x2000, true);
  EXPECT_GT(host.pearson[0], 0.0);
  EXPECT_EQ(host.pearson[1], 2.0);
  for (double x : host.cells[0]) EXPECT_EQ(x, kSentinel);
  // Bit 0x1 with the host's own columns: the expected counts land there.
  TableHost withExpected(3, 2, {20, 15, 30, 25, 10, 8});
  withExpected.run(0x2001);
  EXPECT_EQ(withExpected.pearson[0], host.pearson[0]);
  EXPECT_DOUBLE_EQ(withExpected.cell(0, 0, 0), 35.0 * 60.0 / 108.0);
  // Cramer's V alone still has its expected counts.
  TableHost cramer(3, 2, {20, 15, 30, 25, 10, 8});
  cramer.run(0x20000);
  EXPECT_DOUBLE_EQ(cramer.cramer[0], host.pearson[0] / 108.0);
}

TEST(ContingencyEdges, SameResultsWithOneAndFourThreads) {
  std::mt19937 rng(11);
  std::poisson_distribution<int> count(3.0);
  const unsigned C = 37, R = 29;
  std::vector<double> table(C * R);
  for (double& x : table) x = count(rng);
  const int threads = omp_get_max_threads();
  omp_set_num_threads(1);
  TableHost one(C, R, table);
  one.run();
  omp_set_num_threads(4);
  TableHost four(C, R, table);
  four.run();
  omp_set_num_threads(threads);
  ASSERT_EQ(one.code, 0);
  ASSERT_EQ(four.code, 0);
  EXPECT_TRUE(qeltest::sameBits(one.everything(), four.everything()));
  EXPECT_FALSE(std::isnan(one.concordance[7]));
}

TEST(ContingencyEdges, AllZeroTableGivesNaN) {
  TableHost host(2, 2, {0, 0, 0, 0});
  host.run();
  ASSERT_EQ(host.code, 0);
  for (auto const& v : {host.cells[0], host.cells[1], host.cells[5], host.cells[7]}) {
    for (double x : v) EXPECT_TRUE(std::isnan(x));
  }
  EXPECT_TRUE(allNaN(host.pearson, 3));
  EXPECT_TRUE(allNaN(host.likelihoodRatio, 3));
  EXPECT_TRUE(allNaN(host.cramer, 1));
  EXPECT_TRUE(std::isnan(host.fisher[0]));  // 2 x 2 with empty margins
  EXPECT_TRUE(allNaN(host.mcNemar, 4));
  EXPECT_TRUE(std::isnan(host.pearsonR[0]));
  EXPECT_TRUE(std::isnan(host.spearman[0]));
  EXPECT_TRUE(std::isnan(host.kappa[0]));
  EXPECT_EQ(host.grandTotal[0], 0.0);
}

TEST(ContingencyEdges, OneRowTable) {
  // A 1 x 4 table: one non-empty row, so no test of independence exists.
  TableHost host(4, 1, {5, 3, 8, 2});
  host.run();
  ASSERT_EQ(host.code, 0);
  for (unsigned c = 0; c < 4; ++c) EXPECT_EQ(host.cell(0, c, 0), host.counts[c]);
  EXPECT_EQ(host.pearson[0], 0.0);
  EXPECT_EQ(host.pearson[1], 0.0);  // (R' - 1)(C' - 1)
  EXPECT_EQ(host.likelihoodRatio[0], 0.0);
  EXPECT_TRUE(std::isnan(host.cramer[0]));  // 0 / 0
  EXPECT_TRUE(std::isnan(host.pearsonR[0]));
  EXPECT_EQ(host.fisher[0], -2.0);
  EXPECT_TRUE(allNaN(host.mcNemar, 3));
  EXPECT_EQ(host.mcNemar[3], -2.0);
  EXPECT_TRUE(allNaN(host.mhc, 2));
  EXPECT_EQ(host.mhc[2], -2.0);
  EXPECT_TRUE(std::isnan(host.mhc[3]));
}

TEST(ContingencyEdges, FisherAndMcNemarMarks) {
  TableHost threeByTwo(3, 2, {1, 2, 3, 4, 5, 6});
  threeByTwo.run();
  EXPECT_EQ(threeByTwo.fisher[0], -2.0);
  TableHost zeroColumn(2, 2, {0, 0, 3, 4});
  zeroColumn.run();
  EXPECT_TRUE(std::isnan(zeroColumn.fisher[0]));
  // b = c = 0: estimate 0, bounds -+ 1/N, P-value min(1, 2 P(X <= 0 | n = 0)).
  TableHost concordant(2, 2, {6, 0, 0, 4});
  concordant.run();
  EXPECT_EQ(concordant.mcNemar[0], 0.0);
  EXPECT_DOUBLE_EQ(concordant.mcNemar[1], -0.1);
  EXPECT_DOUBLE_EQ(concordant.mcNemar[2], 0.1);
  EXPECT_EQ(concordant.mcNemar[3], 1.0);
  // Non-integer counts: each of x, N, row 0 and column 0 total is
  // truncated, here to x = 3, N = 12, M = trunc(6.6) = 6, n = trunc(4.9) = 4.
  // P(X = k) = C(6, k) C(6, 4 - k) / 495 = (15, 120, 225, 120, 15) / 495,
  // and the outcomes no more probable than k = 3 sum to 270 / 495.
  TableHost fractional(2, 2, {3.7, 1.2, 2.9, 4.4});
  fractional.run();
  EXPECT_NEAR(fractional.fisher[0], 270.0 / 495.0, 1e-14);
}

TEST(ContingencyEdges, KappaMarks) {
  // Marks longer than the table stop at its edge (Cohen's kappa of
  // ((8, 2), (1, 9)) is 0.7); null marks give NaN.
  TableHost longMarks(2, 2, {8, 2, 1, 9});
  longMarks.marks.assign(6, 0.0);
  longMarks.run(0x40000);
  EXPECT_DOUBLE_EQ(longMarks.kappa[0], 0.7);
  int code = -1;
  qel::IContingencyTable* t = qel::MakeIContingencyTable(2, 2, 0x40000, &code);
  double counts[4] = {8, 2, 1, 9}, kappa = kSentinel;
  t->SetupObservedCounts(counts, 0);
  t->SetupObservedCounts(counts + 2, 1);
  t->SetupKappa(nullptr, &kappa, 2);
  EXPECT_EQ(t->Analyze(), 0);
  EXPECT_TRUE(std::isnan(kappa));
  qel::DeleteIContingencyTable(&t);
}

TEST(ContingencyEdges, NegativeAndNaNCounts) {
  TableHost negative(2, 2, {5, -1, 3, 4});
  negative.run();
  EXPECT_EQ(negative.code, 0);
  EXPECT_TRUE(std::isnan(negative.fisher[0]));  // not a table of counts
  EXPECT_TRUE(std::isnan(negative.mcNemar[3]));
  // A NaN count: no margin to test against, so the tests give NaN.
  TableHost nan(3, 2, {5, kNaN, 3, 4, 2, 7});
  nan.run();
  EXPECT_EQ(nan.code, 0);
  EXPECT_TRUE(allNaN(nan.pearson, 3));
  EXPECT_TRUE(allNaN(nan.likelihoodRatio, 3));
  EXPECT_TRUE(std::isnan(nan.cramer[0]));
  EXPECT_TRUE(std::isnan(nan.pearsonR[0]));
  EXPECT_TRUE(std::isnan(nan.spearman[0]));
  EXPECT_TRUE(std::isnan(nan.concordance[6]));
  EXPECT_TRUE(std::isnan(nan.grandTotal[0]));
}

TEST(ContingencyEdges, CarelessHost) {
  int code = -1;
  // Analyze before any counts: a column never lent counts as zeros.
  qel::IContingencyTable* t = qel::MakeIContingencyTable(3, 2, kAllTableResults, &code);
  ASSERT_NE(t, nullptr);
  EXPECT_EQ(code, 0);
  double pearson[3] = {kSentinel, kSentinel, kSentinel}, grand = kSentinel;
  t->SetupPearsonChisquareTest(pearson);
  t->SetupGrandTotal(&grand);
  EXPECT_EQ(t->Analyze(), 0);
  EXPECT_TRUE(allNaN(pearson, 3));
  EXPECT_EQ(grand, 0.0);
  // Requested results without buffers, and Setup calls out of range.
  double counts[6] = {20, 15, 30, 25, 10, 8}, stray[2] = {kSentinel, kSentinel};
  for (unsigned c = 0; c < 3; ++c) t->SetupObservedCounts(counts + 2 * c, c);
  t->SetupObservedCounts(stray, 3);
  t->SetupExpectedCounts(stray, 7);
  EXPECT_EQ(t->Analyze(), 0);
  EXPECT_EQ(pearson[1], 2.0);
  EXPECT_EQ(grand, 108.0);
  EXPECT_EQ(stray[0], kSentinel);
  qel::DeleteIContingencyTable(&t);
  EXPECT_EQ(t, nullptr);
  qel::DeleteIContingencyTable(&t);  // a null pointer is left alone

  // A mask of 0 computes nothing; dimensions of 0 are accepted.
  t = qel::MakeIContingencyTable(2, 2, 0, &code);
  t->SetupGrandTotal(&grand);
  grand = kSentinel;
  EXPECT_EQ(t->Analyze(), 0);
  EXPECT_EQ(grand, kSentinel);
  qel::DeleteIContingencyTable(&t);
  t = qel::MakeIContingencyTable(0, 0, kAllTableResults, &code);
  ASSERT_NE(t, nullptr);
  t->SetupGrandTotal(&grand);
  EXPECT_EQ(t->Analyze(), 0);
  EXPECT_EQ(grand, 0.0);
  qel::DeleteIContingencyTable(&t);
}

// Runs the strata through one object and finalizes.
std::vector<double> stratified(unsigned C, unsigned R, std::vector<std::vector<double>> strata) {
  int code = -1;
  qel::IContingencyTable* t = qel::MakeIContingencyTable(C, R, 0x800000, &code);
  std::vector<double> result(4, kSentinel);
  for (auto& stratum : strata) {
    for (unsigned c = 0; c < C; ++c) t->SetupObservedCounts(stratum.data() + c * R, c);
    t->SetupMHCTest(result.data());
    EXPECT_EQ(t->Analyze(), 0);
  }
  t->FinalizeMHCTest(result.data());
  qel::DeleteIContingencyTable(&t);
  return result;
}

TEST(ContingencyEdges, MantelHaenszelStrata) {
  // The values of ordinary strata are R's rows (contingency_r.csv).
  const std::vector<double> two = stratified(2, 2, {{3, 1, 2, 4}, {5, 5, 1, 9}});
  // |sum of a - E| below 1/2: the correction is still 1/2 (R's
  // mantelhaen.test would take |sum| itself), s = 0.2 - 0.5 and s^2 = 0.09.
  // ((4, 2), (3, 1)): T = (6, 4), U = (7, 3), a - E = 4 - 7 * 6 / 10 = -0.2,
  // V = 3 * 4 / 10 * 4.2 / 9.
  const std::vector<double> small = stratified(2, 2, {{4, 2, 3, 1}});
  EXPECT_NEAR(small[1], 0.09 / (3.0 * 4.0 / 10.0 * 4.2 / 9.0), 1e-14);
  EXPECT_DOUBLE_EQ(small[0], (4.0 * 1.0 / 10.0) / (2.0 * 3.0 / 10.0));
  // A first stratum of the wrong shape spoils the run.
  const std::vector<double> invalid = stratified(3, 2, {{1, 2, 3, 4, 5, 6}});
  EXPECT_TRUE(std::isnan(invalid[0]) && std::isnan(invalid[1]) && std::isnan(invalid[3]));
  EXPECT_EQ(invalid[2], -2.0);
  // A 2 x 2 stratum with an empty margin adds nothing.
  const std::vector<double> skipped = stratified(2, 2, {{3, 1, 2, 4}, {0, 0, 5, 5}, {5, 5, 1, 9}});
  EXPECT_EQ(skipped, two);
}

TEST(ContingencyEdges, LaterStratumOfAnotherShapeIsSkipped) {
  // An object has one shape for good, so this reaches the stratum function
  // itself: a 3 x 2 stratum after a 2 x 2 one changes neither the sums nor
  // the flags.
  double a[2] = {3, 1}, b[2] = {2, 4};
  double const* table[2] = {a, b};
  double T[2] = {4, 6}, U[2] = {5, 5}, sums[4] = {0, 0, 0, 0};
  bool first = true, invalid = false;
  qel::GetMHCTest(table, T, U, sums, &first, &invalid, 10, 2, 2, 2, 2, 0x800000);
  const std::vector<double> after(sums, sums + 4);
  double const* wide[3] = {a, b, a};
  double T3[3] = {4, 6, 4};
  qel::GetMHCTest(wide, T3, U, sums, &first, &invalid, 14, 3, 2, 3, 2, 0x800000);
  EXPECT_FALSE(first);
  EXPECT_FALSE(invalid);
  EXPECT_EQ(std::vector<double>(sums, sums + 4), after);
  EXPECT_EQ(after[0], 1.0);
}

}  // namespace
