// Allocation failure in the functions that allocate scratch: they catch
// std::bad_alloc themselves and answer 30001 with NaN outputs. The global
// operator new of the test program is replaced so that a test can make the
// next allocation fail.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/contingency_table.h>
#include <qel/descriptive.h>
#include <qel/fits.h>
#include <qel/location_tests.h>
#include <qel/order_statistics.h>

#include <atomic>
#include <cmath>
#include <cstdlib>
#include <new>

namespace {
bool failNextAllocation = false;
// When not negative: the number of allocations to grant before one fails
// (on any thread).
std::atomic<int> failAllocationAfter{-1};
}  // namespace

void* operator new(std::size_t size) {
  if (failNextAllocation) {
    failNextAllocation = false;
    throw std::bad_alloc();
  }
  if (failAllocationAfter.load(std::memory_order_relaxed) >= 0 && failAllocationAfter-- == 0) {
    throw std::bad_alloc();
  }
  if (void* p = std::malloc(size ? size : 1)) return p;
  throw std::bad_alloc();
}
// The replacement new takes its memory from malloc, so free is the matching
// release; the compiler cannot see that pairing.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wmismatched-new-delete"
void operator delete(void* p) noexcept {
  std::free(p);
}
void operator delete(void* p, std::size_t) noexcept {
  std::free(p);
}
// The array and no-throw forms too: the sanitizer runtime would otherwise
// serve them itself, without the replacement's failure, and its memory would
// then reach the free() of the deletes here.
void* operator new[](std::size_t size) {
  return operator new(size);
}
void* operator new(std::size_t size, std::nothrow_t const&) noexcept {
  try {
    return operator new(size);
  } catch (std::bad_alloc const&) {
    return nullptr;
  }
}
void* operator new[](std::size_t size, std::nothrow_t const&) noexcept {
  return operator new(size, std::nothrow);
}
void operator delete[](void* p) noexcept {
  std::free(p);
}
void operator delete[](void* p, std::size_t) noexcept {
  std::free(p);
}
#pragma GCC diagnostic pop

namespace {

TEST(AllocationFailure, RankAndSpearmanReportOutOfMemory) {
  const double x[] = {3.0, 1.0, 2.0};
  const double y[] = {1.0, 2.0, 3.0};
  double rank[3] = {0.0, 0.0, 0.0};
  failNextAllocation = true;
  EXPECT_EQ(qel::v1::GetRank(x, 3, rank), qel::qelFailOutOfMemory);
  failNextAllocation = false;
  for (double r : rank) EXPECT_TRUE(std::isnan(r));

  int status = -1;
  failNextAllocation = true;
  EXPECT_TRUE(std::isnan(qel::v1::GetSpearmanCorrelation(x, y, 3, &status)));
  failNextAllocation = false;
  EXPECT_EQ(status, qel::qelFailOutOfMemory);

  // With memory again, the same calls succeed.
  EXPECT_EQ(qel::v1::GetRank(x, 3, rank), qel::qelOk);
  EXPECT_EQ(rank[0], 3.0);
  EXPECT_EQ(qel::v1::GetSpearmanCorrelation(x, y, 3, &status), -0.5);
  EXPECT_EQ(status, qel::qelOk);
}

// The order statistics that sort a copy: the copy fails, the outputs are
// NaN (or reset) and the code or status is 30001.
TEST(AllocationFailure, OrderStatisticsReportOutOfMemory) {
  const double x[] = {4.0, 1.0, 4.0, 2.0};
  const double p[] = {0.25, 0.5};
  double q[2] = {0.0, 0.0};
  failNextAllocation = true;
  EXPECT_EQ(qel::v1::GetSampleQuantiles(x, 4, 7, q, p, 2), qel::qelFailOutOfMemory);
  failNextAllocation = false;
  EXPECT_TRUE(std::isnan(q[0]) && std::isnan(q[1]));

  int status = -1;
  failNextAllocation = true;
  EXPECT_TRUE(std::isnan(qel::v1::GetLynTrimmedMean(x, 4, &status)));
  failNextAllocation = false;
  EXPECT_EQ(status, qel::qelFailOutOfMemory);
  status = -1;
  failNextAllocation = true;
  EXPECT_TRUE(std::isnan(qel::v1::GetTrimmedMean(x, 4, 0.25, &status)));
  failNextAllocation = false;
  EXPECT_EQ(status, qel::qelFailOutOfMemory);

  double modes[2] = {0.0, 0.0};
  unsigned count = 9, frequency = 9;
  failNextAllocation = true;
  EXPECT_EQ(qel::v1::GetMode(x, 4, modes, 2, &count, &frequency), qel::qelFailOutOfMemory);
  failNextAllocation = false;
  EXPECT_TRUE(std::isnan(modes[0]) && std::isnan(modes[1]));
  EXPECT_EQ(count, 0u);
  EXPECT_EQ(frequency, 0u);

  // With memory again, the same calls succeed.
  EXPECT_EQ(qel::v1::GetSampleQuantiles(x, 4, 7, q, p, 2), qel::qelOk);
  EXPECT_EQ(q[1], 3.0);
  EXPECT_EQ(qel::v1::GetTrimmedMean(x, 4, 0.25, &status), 3.0);
  EXPECT_EQ(status, qel::qelOk);
  EXPECT_EQ(qel::v1::GetMode(x, 4, modes, 2, &count, &frequency), qel::qelOk);
  EXPECT_EQ(modes[0], 4.0);
  EXPECT_EQ(count, 1u);
}

TEST(AllocationFailure, PairedTStopsAfterTheColumnSummaries) {
  const double x[] = {3.0, 1.0, 2.0};
  const double y[] = {1.0, 2.0, 2.0};
  qel::v0::PairedT record;
  record.n = 3;
  failNextAllocation = true;
  EXPECT_EQ(qel::v0::RunPairedT(&record, x, y, 0.95, qel::kIntervalTwoSided,
                                qel::kAlternativeNotEqual, 0.0),
            qel::qelFailOutOfMemory);
  failNextAllocation = false;
  EXPECT_EQ(record.firstMean, 2.0);
  EXPECT_DOUBLE_EQ(record.secondStandardError, std::sqrt(1.0 / 3.0) / std::sqrt(3.0));
  EXPECT_TRUE(std::isnan(record.meanDifference) && std::isnan(record.standardErrorOfDifferences) &&
              std::isnan(record.lowerLimit) && std::isnan(record.upperLimit) &&
              std::isnan(record.statistic) && std::isnan(record.pValue));

  EXPECT_EQ(qel::v0::RunPairedT(&record, x, y, 0.95, qel::kIntervalTwoSided), qel::qelOk);
  EXPECT_DOUBLE_EQ(record.meanDifference, 1.0 / 3.0);
}

TEST(AllocationFailure, FitsAndPlotsReportOutOfMemory) {
  const double x[4] = {0.5, 1.0, 2.0, 3.5};
  double par[2] = {0, 0}, cov[3] = {0, 0, 0}, scores[4], a2 = 0, p = 0;
  failNextAllocation = true;
  EXPECT_EQ(qel::v2::FitWeibull(x, par, 4), qel::qelFailOutOfMemory);
  EXPECT_TRUE(std::isnan(par[0]) && std::isnan(par[1]));
  failNextAllocation = true;
  EXPECT_EQ(qel::v2::FitLynLogNormal(x, par, 4), qel::qelFailOutOfMemory);
  EXPECT_TRUE(std::isnan(par[0]) && std::isnan(par[1]));
  failNextAllocation = true;
  EXPECT_EQ(
      qel::v1::RunLynLogNormalPPlot(x, scores, nullptr, par, cov, &a2, &p, 4, qel::kPlotMedianRank),
      qel::qelFailOutOfMemory);
  EXPECT_TRUE(std::isnan(par[0]) && std::isnan(cov[2]) && std::isnan(a2) && std::isnan(p));
  failNextAllocation = true;
  EXPECT_EQ(
      qel::v0::RunLynWeibullPPlot(x, scores, nullptr, par, cov, &a2, &p, 4, qel::kPlotMedianRank),
      qel::qelFailOutOfMemory);
  EXPECT_TRUE(std::isnan(par[1]) && std::isnan(cov[0]) && std::isnan(a2) && std::isnan(p));

  // With memory again, the same calls succeed.
  EXPECT_EQ(qel::v2::FitWeibull(x, par, 4), qel::qelOk);
  EXPECT_TRUE(std::isfinite(par[0]) && std::isfinite(par[1]));
}

}  // namespace

#include <qel/summaries.h>

namespace {

TEST(AllocationFailure, SummariesReportOutOfMemory) {
  const double x[] = {4.0, 1.0, 3.0, 3.0, 2.0};
  qel::v1::LynBoxplotHelper box;
  box.mean = 0.0;
  failNextAllocation = true;
  EXPECT_EQ(qel::v1::RunLynBoxplotHelper(&box, 0.9, x, 5), qel::qelFailOutOfMemory);
  failNextAllocation = false;
  for (double v : {box.minimum, box.maximum, box.firstQuartile, box.median, box.thirdQuartile,
                   box.medianLowerLimit, box.medianUpperLimit, box.lowerHinge, box.upperHinge,
                   box.mean, box.standardDeviation}) {
    EXPECT_TRUE(std::isnan(v));
  }

  qel::v1::SecondSampleMoments moments;
  moments.n = 5;
  qel::v1::FiveNumberSummary five;
  double modes[5] = {0, 0, 0, 0, 0};
  unsigned modeCount = 9, frequency = 9;
  failNextAllocation = true;
  EXPECT_EQ(qel::v1::GetLyn2013ExtendedSummary(&moments, &five, modes, &modeCount, &frequency, x),
            qel::qelFailOutOfMemory);
  failNextAllocation = false;
  EXPECT_TRUE(std::isnan(five.median));
  EXPECT_TRUE(std::isnan(modes[0]));
  EXPECT_EQ(modeCount, 0u);
  EXPECT_EQ(moments.mean, 2.6);  // the moments need no scratch

  five.median = 0.0;
  failNextAllocation = true;
  EXPECT_EQ(qel::v1::GetLynFiveNumberSummary(&five, x, 5), qel::qelFailOutOfMemory);
  failNextAllocation = false;
  EXPECT_EQ(five.median, 0.0);  // written only on success

  // With memory again the helper succeeds.
  EXPECT_EQ(qel::v1::RunLynBoxplotHelper(&box, 0.9, x, 5), qel::qelOk);
  EXPECT_EQ(box.median, 3.0);
}

}  // namespace

namespace {

// Every allocation of MakeIContingencyTable in turn fails: a null table and
// 30001, never a half-made object. Then every allocation of Analyze: 30001,
// kept by the object for later passes.
TEST(AllocationFailure, ContingencyTableReportsOutOfMemory) {
  int failures = 0;
  for (int k = 0; k < 50; ++k) {
    int code = -1;
    failAllocationAfter = k;
    qel::IContingencyTable* t = qel::MakeIContingencyTable(3, 3, 0xFFFFFF, &code);
    failAllocationAfter = -1;
    if (t != nullptr) {
      EXPECT_EQ(code, 0);
      qel::DeleteIContingencyTable(&t);
      break;
    }
    EXPECT_EQ(code, qel::qelFailOutOfMemory);
    ++failures;
  }
  EXPECT_GE(failures, 3);  // the object, the observed array, a result array

  double counts[9] = {4, 2, 1, 3, 5, 2, 1, 2, 6};
  double pearson[3], concordance[9], goodmanKruskal[4], spearman;
  failures = 0;
  for (int k = 0; k < 50; ++k) {
    int code = -1;
    qel::IContingencyTable* t = qel::MakeIContingencyTable(3, 3, 0xFFFFFF & ~0x1u, &code);
    ASSERT_NE(t, nullptr);
    for (unsigned c = 0; c < 3; ++c) t->SetupObservedCounts(counts + 3 * c, c);
    t->SetupPearsonChisquareTest(pearson);
    t->SetupMeasuresOfConcordance(concordance);
    t->SetupGoodmanKruskal(goodmanKruskal);
    t->SetupSpearmanRho(&spearman);
    failAllocationAfter = k;
    code = t->Analyze();
    failAllocationAfter = -1;
    if (code == qel::qelOk) {
      EXPECT_EQ(pearson[1], 4.0);
      qel::DeleteIContingencyTable(&t);
      break;
    }
    EXPECT_EQ(code, qel::qelFailOutOfMemory);
    EXPECT_EQ(t->Analyze(), qel::qelFailOutOfMemory);  // the code is kept
    qel::DeleteIContingencyTable(&t);
    ++failures;
  }
  // Temporary totals, expected counts and the scratch of three sections.
  EXPECT_GE(failures, 4);
}

}  // namespace
