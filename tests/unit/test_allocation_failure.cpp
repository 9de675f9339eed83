// Allocation failure in the functions that allocate scratch: they catch
// std::bad_alloc themselves and answer 30001 with NaN outputs. The global
// operator new of the test program is replaced so that a test can make the
// next allocation fail.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/contingency_table.h>
#include <qel/distributions.h>
#include <qel/descriptive.h>
#include <qel/fits.h>
#include <qel/location_tests.h>
#include <qel/order_statistics.h>

#include <atomic>
#include <cmath>
#include <cstdlib>
#include <new>
#include <vector>

#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/studentized_maximum.h"

namespace {
bool failNextAllocation = false;
// Counts down with every allocation, from any thread; the allocation that
// finds it at 0 fails. Negative: disarmed.
std::atomic<long> allocationsBeforeFailure{-1};
}  // namespace

void* operator new(std::size_t size) {
  if (failNextAllocation) {
    failNextAllocation = false;
    throw std::bad_alloc();
  }
  if (allocationsBeforeFailure.load() >= 0 && allocationsBeforeFailure.fetch_sub(1) == 0) {
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

#include <qel/summaries.h>

namespace {

// Runs f with its first allocation failing; returns f's result.
template <class F>
auto failingFirstAllocation(F f) {
  failNextAllocation = true;
  const auto result = f();
  failNextAllocation = false;
  return result;
}

bool nan(std::initializer_list<double> values) {
  for (double v : values) {
    if (!std::isnan(v)) return false;
  }
  return true;
}

constexpr int kOom = qel::qelFailOutOfMemory;

// The functions that sort or rank a copy: the copy fails, the outputs are
// NaN (or reset) and the code or status is 30001; with memory again the
// same calls succeed.
TEST(AllocationFailure, RanksOrderStatisticsAndSummariesReportOutOfMemory) {
  const double x[] = {4.0, 1.0, 3.0, 3.0, 2.0}, y[] = {1.0, 2.0, 3.0, 4.0, 5.0};
  const double p[] = {0.25, 0.5};
  double out[5] = {0, 0, 0, 0, 0};
  int status = -1;
  EXPECT_EQ(failingFirstAllocation([&] { return qel::v1::GetRank(x, 3, out); }), kOom);
  EXPECT_TRUE(nan({out[0], out[1], out[2]}));
  EXPECT_TRUE(std::isnan(
      failingFirstAllocation([&] { return qel::v1::GetSpearmanCorrelation(x, y, 3, &status); })));
  EXPECT_EQ(status, kOom);
  EXPECT_EQ(failingFirstAllocation([&] { return qel::v1::GetSampleQuantiles(x, 4, 7, out, p, 2); }),
            kOom);
  EXPECT_TRUE(nan({out[0], out[1]}));
  status = -1;
  EXPECT_TRUE(std::isnan(
      failingFirstAllocation([&] { return qel::v1::GetLynTrimmedMean(x, 4, &status); })));
  EXPECT_EQ(status, kOom);
  status = -1;
  EXPECT_TRUE(std::isnan(
      failingFirstAllocation([&] { return qel::v1::GetTrimmedMean(x, 4, 0.25, &status); })));
  EXPECT_EQ(status, kOom);
  unsigned count = 9, frequency = 9;
  EXPECT_EQ(
      failingFirstAllocation([&] { return qel::v1::GetMode(x, 4, out, 2, &count, &frequency); }),
      kOom);
  EXPECT_TRUE(nan({out[0], out[1]}) && count == 0u && frequency == 0u);

  qel::v1::LynBoxplotHelper box;
  box.mean = 0.0;
  EXPECT_EQ(failingFirstAllocation([&] { return qel::v1::RunLynBoxplotHelper(&box, 0.9, x, 5); }),
            kOom);
  EXPECT_TRUE(nan({box.minimum, box.maximum, box.firstQuartile, box.median, box.thirdQuartile,
                   box.medianLowerLimit, box.medianUpperLimit, box.lowerHinge, box.upperHinge,
                   box.mean, box.standardDeviation}));
  qel::v1::SecondSampleMoments moments;
  moments.n = 5;
  qel::v1::FiveNumberSummary five;
  EXPECT_EQ(failingFirstAllocation([&] {
              return qel::v1::GetLyn2013ExtendedSummary(&moments, &five, out, &count, &frequency,
                                                        x);
            }),
            kOom);
  EXPECT_TRUE(nan({five.median, out[0]}) && count == 0u);
  EXPECT_EQ(moments.mean, 2.6);  // the moments need no scratch
  five.median = 0.0;
  EXPECT_EQ(failingFirstAllocation([&] { return qel::v1::GetLynFiveNumberSummary(&five, x, 5); }),
            kOom);
  EXPECT_EQ(five.median, 0.0);  // written only on success

  EXPECT_EQ(qel::v1::GetRank(x, 3, out), qel::qelOk);
  EXPECT_EQ(out[0], 3.0);
  EXPECT_EQ(qel::v1::GetSpearmanCorrelation(x, y, 3, &status), -0.5);
  EXPECT_EQ(qel::v1::GetTrimmedMean(x, 4, 0.25, &status), 3.0);
  EXPECT_EQ(qel::v1::GetMode(x, 5, out, 2, &count, &frequency), qel::qelOk);
  EXPECT_EQ(out[0], 3.0);
  EXPECT_EQ(qel::v1::RunLynBoxplotHelper(&box, 0.9, x, 5), qel::qelOk);
  EXPECT_EQ(box.median, 3.0);
}

TEST(AllocationFailure, PairedTStopsAfterTheColumnSummaries) {
  const double x[] = {3.0, 1.0, 2.0};
  const double y[] = {1.0, 2.0, 2.0};
  qel::v0::PairedT record;
  record.n = 3;
  EXPECT_EQ(failingFirstAllocation([&] {
              return qel::v0::RunPairedT(&record, x, y, 0.95, qel::kIntervalTwoSided,
                                         qel::kAlternativeNotEqual, 0.0);
            }),
            kOom);
  EXPECT_EQ(record.firstMean, 2.0);
  EXPECT_DOUBLE_EQ(record.secondStandardError, std::sqrt(1.0 / 3.0) / std::sqrt(3.0));
  EXPECT_TRUE(nan({record.meanDifference, record.standardErrorOfDifferences, record.lowerLimit,
                   record.upperLimit, record.statistic, record.pValue}));
  EXPECT_EQ(qel::v0::RunPairedT(&record, x, y, 0.95, qel::kIntervalTwoSided), qel::qelOk);
  EXPECT_DOUBLE_EQ(record.meanDifference, 1.0 / 3.0);
}

TEST(AllocationFailure, FitsAndPlotsReportOutOfMemory) {
  const double x[4] = {0.5, 1.0, 2.0, 3.5};
  double par[2] = {0, 0}, cov[3] = {0, 0, 0}, scores[4], a2 = 0, p = 0;
  EXPECT_EQ(failingFirstAllocation([&] { return qel::v2::FitWeibull(x, par, 4); }), kOom);
  EXPECT_TRUE(nan({par[0], par[1]}));
  EXPECT_EQ(failingFirstAllocation([&] { return qel::v2::FitLynLogNormal(x, par, 4); }), kOom);
  EXPECT_TRUE(nan({par[0], par[1]}));
  EXPECT_EQ(failingFirstAllocation([&] {
              return qel::v1::RunLynLogNormalPPlot(x, scores, nullptr, par, cov, &a2, &p, 4,
                                                   qel::kPlotMedianRank);
            }),
            kOom);
  EXPECT_TRUE(nan({par[0], cov[2], a2, p}));
  EXPECT_EQ(failingFirstAllocation([&] {
              return qel::v0::RunLynWeibullPPlot(x, scores, nullptr, par, cov, &a2, &p, 4,
                                                 qel::kPlotMedianRank);
            }),
            kOom);
  EXPECT_TRUE(nan({par[1], cov[0], a2, p}));
  EXPECT_EQ(qel::v2::FitWeibull(x, par, 4), qel::qelOk);
  EXPECT_TRUE(std::isfinite(par[0]) && std::isfinite(par[1]));
}

}  // namespace

#include <qel/rank_tests.h>
#include <qel/sign_tests.h>

#include <functional>
#include <vector>

namespace {

// Makes the k-th allocation of `run` fail, for k = 0, 1, ... until a run
// completes within k allocations, so that every allocation of the routine,
// including those inside its parallel loops, fails once. Each failing run
// must answer 30001 and pass `afterFailure`; the last run must succeed.
// Returns the number of allocations met.
int failEachAllocation(const std::function<int()>& run,
                       const std::function<void(int)>& afterFailure) {
  for (int k = 0; k < 1000; ++k) {
    allocationsBeforeFailure = k;
    const int code = run();
    const bool failed = allocationsBeforeFailure.load() < 0;
    allocationsBeforeFailure = -1;
    if (!failed) {
      EXPECT_EQ(code, qel::qelOk) << "run without a failure";
      return k;
    }
    EXPECT_EQ(code, qel::qelFailOutOfMemory) << "allocation " << k << " failed";
    afterFailure(k);
  }
  ADD_FAILURE() << "the routine allocates without end";
  return -1;
}

const std::vector<double> kFirst = {1.83, 0.50, 1.62, 2.48, 1.68, 1.88, 1.55, 3.06, 1.30, 1.62};
const std::vector<double> kSecond = {0.878, 0.647, 0.598, 2.05, 1.06, 1.29, 1.06, 3.14, 1.29};
const std::vector<double> kThird = {2.1, 3.3, 2.9, 4.0, 1.9, 3.6};

TEST(AllocationFailure, MannWhitneyResetsTheRecord) {
  qel::v0::MannWhitney record;
  record.firstN = static_cast<int>(kFirst.size());
  record.secondN = static_cast<int>(kSecond.size());
  const auto run = [&] {
    return qel::v0::RunLynMannWhitney(&record, kFirst.data(), kSecond.data(), 0.95,
                                      qel::kIntervalTwoSided, qel::kAlternativeNotEqual);
  };
  const int allocations = failEachAllocation(run, [&](int k) {
    EXPECT_TRUE(nan({record.firstMedian, record.secondMedian, record.estimate, record.lowerLimit,
                     record.upperLimit, record.achievedConfidence, record.statistic, record.pValue,
                     record.adjustedPValue}))
        << "allocation " << k;
  });
  EXPECT_GT(allocations, 2);
  EXPECT_EQ(record.statistic, 120.0);  // the complete run: W of the first sample (R)
}

// A group whose median copy fails stays NaN while the rank statistics of
// every group are still computed; earlier failures leave the record NaN.
TEST(AllocationFailure, KruskalWallisCountsTheGroupsThatFailed) {
  qel::v0::KruskalWallisGroup groups[3] = {
      {0, 0, 0, kFirst.data(), 10}, {0, 0, 0, kSecond.data(), 9}, {0, 0, 0, kThird.data(), 6}};
  qel::v0::KruskalWallis record;
  record.groups = groups;
  record.groupCount = 3;
  int medianFailures = 0;
  const int allocations = failEachAllocation(
      [&] { return qel::v0::RunLynKruskalWallis(&record); },
      [&](int) {
        if (std::isnan(record.statistic)) return;
        ++medianFailures;
        EXPECT_TRUE(std::isnan(groups[0].median) || std::isnan(groups[1].median) ||
                    std::isnan(groups[2].median));
        EXPECT_TRUE(std::isfinite(groups[0].z) && std::isfinite(groups[2].z));
      });
  EXPECT_EQ(medianFailures, 3);  // one copy per group
  EXPECT_GE(allocations, 4);
  EXPECT_EQ(groups[1].median, 1.06);
}

TEST(AllocationFailure, MoodReportsOutOfMemory) {
  qel::v0::MoodGroup groups[2] = {};
  groups[0].data = kFirst.data();
  groups[0].n = 10;
  groups[1].data = kSecond.data();
  groups[1].n = 9;
  qel::v0::Mood record;
  record.groups = groups;
  record.groupCount = 2;
  const int allocations =
      failEachAllocation([&] { return qel::v0::RunLynMood(&record); }, [](int) {});
  EXPECT_GT(allocations, 2);
  EXPECT_EQ(record.overallMedian, 1.55);
  EXPECT_TRUE(std::isfinite(record.lowerLimit) && std::isfinite(record.upperLimit));
}

// The columns are overwritten with fitted values, so each run starts from a
// fresh copy; a failed run must not disturb the next one.
TEST(AllocationFailure, FriedmanReportsOutOfMemory) {
  const std::vector<double> table[3] = {{1.83, 0.50, 1.62, 2.48, 1.68, 1.88},
                                        {0.878, 0.647, 0.598, 2.05, 1.06, 1.29},
                                        {2.1, 3.3, 2.9, 4.0, 1.9, 3.6}};
  std::vector<double> columns[3];
  qel::v0::FriedmanTreatment treatments[3];
  qel::v0::Friedman record;
  record.treatments = treatments;
  record.blocks = 6;
  record.treatmentCount = 3;
  const auto run = [&] {
    for (int t = 0; t < 3; ++t) {
      std::copy(table[t].begin(), table[t].end(), columns[t].begin());
      treatments[t].column = columns[t].data();
    }
    return qel::v0::RunLynFriedman(&record);
  };
  for (auto& c : columns) c.resize(6);
  const int allocations = failEachAllocation(run, [](int) {});
  EXPECT_GT(allocations, 3);
  EXPECT_DOUBLE_EQ(record.statistic, 31.0 / 3.0);  // rank sums 11, 7, 18
  EXPECT_EQ(treatments[1].rankSum, 7.0);
}

TEST(AllocationFailure, SignAndWilcoxonReportOutOfMemory) {
  qel::v0::OneSampleSign sign;
  sign.n = 10;
  int allocations = failEachAllocation(
      [&] {
        return qel::v0::RunLynOneSampleSign(&sign, kFirst.data(), 0.9, qel::kIntervalTwoSided,
                                            qel::kAlternativeNotEqual, 1.0);
      },
      [&](int k) {
        EXPECT_TRUE(std::isnan(sign.pValue) && std::isnan(sign.interpolatedLowerLimit))
            << "allocation " << k;
      });
  EXPECT_GE(allocations, 1);
  EXPECT_EQ(sign.countAbove, 9.0);

  qel::v0::OneSampleWilcoxon wilcoxon;
  wilcoxon.n = 10;
  allocations = failEachAllocation(
      [&] {
        wilcoxon.n = 10;
        return qel::v0::RunLynOneSampleWilcoxon(
            &wilcoxon, kFirst.data(), 0.95, qel::kIntervalTwoSided, qel::kAlternativeNotEqual, 1.0);
      },
      [&](int k) { EXPECT_TRUE(std::isnan(wilcoxon.pValue)) << "allocation " << k; });
  EXPECT_GT(allocations, 1);
  EXPECT_EQ(wilcoxon.W, 53.0);  // V of R's wilcox.test(x - 1)
}

}  // namespace

namespace {

// Every allocation of MakeIContingencyTable in turn fails: a null table and
// 30001, never a half-made object. Then every allocation of Analyze: 30001,
// kept by the object for later passes.
TEST(AllocationFailure, ContingencyTableReportsOutOfMemory) {
  qel::IContingencyTable* t = nullptr;
  const int made = failEachAllocation(
      [&] {
        int code = -1;
        t = qel::MakeIContingencyTable(3, 3, 0xFFFFFF, &code);
        return code;
      },
      [&](int k) { EXPECT_EQ(t, nullptr) << "allocation " << k; });
  qel::DeleteIContingencyTable(&t);
  EXPECT_GE(made, 3);  // the object, the observed array, a result array

  double counts[9] = {4, 2, 1, 3, 5, 2, 1, 2, 6};
  double pearson[3], concordance[9], goodmanKruskal[4], spearman;
  auto prepare = [&] {
    int code = -1;
    qel::IContingencyTable* table = qel::MakeIContingencyTable(3, 3, 0xFFFFFF & ~0x1u, &code);
    for (unsigned c = 0; c < 3; ++c) table->SetupObservedCounts(counts + 3 * c, c);
    table->SetupPearsonChisquareTest(pearson);
    table->SetupMeasuresOfConcordance(concordance);
    table->SetupGoodmanKruskal(goodmanKruskal);
    table->SetupSpearmanRho(&spearman);
    return table;
  };
  // The tables are made outside the counted runs, so that only Analyze's
  // own allocations fail.
  t = prepare();
  const int analyzed = failEachAllocation([&] { return t->Analyze(); },
                                          [&](int k) {
                                            EXPECT_EQ(t->Analyze(), qel::qelFailOutOfMemory)
                                                << "the code is kept, " << k;
                                            qel::DeleteIContingencyTable(&t);
                                            t = prepare();
                                          });
  EXPECT_EQ(pearson[1], 4.0);
  qel::DeleteIContingencyTable(&t);
  // Temporary totals, expected counts and the scratch of three sections.
  EXPECT_GE(analyzed, 4);
}

}  // namespace

#include "proxies/rows.h"
#include "utilities/MathUtilities.h"

namespace {

// The all-rows form of a row set holds no list: building it, reading it and
// taking a range over it allocate nothing (any allocation would throw here).
TEST(AllocationFailure, AllRowsFormNeverAllocates) {
  const std::vector<double> x(100, 1.5);
  qel::CbRows rows;
  double lo = 0.0, hi = 0.0;
  long sum = 0;
  allocationsBeforeFailure = 0;
  EXPECT_NO_THROW({
    rows.mUseAllRows(2000000000);
    for (int i = 0; i < 1000; ++i) sum += rows.mGetRow(i * 1999999);
    qel::CbRows copy(rows);
    sum += copy.mGetRowCt() + (copy == rows ? 1 : 0);
    rows.mFilterRowsInclude(100);
    qel::mMinMax(x, rows, &lo, &hi);
    qel::mMinMax(x.data(), 100, &lo, &hi);
  });
  const bool allocated = allocationsBeforeFailure.load() < 0;
  allocationsBeforeFailure = -1;
  EXPECT_FALSE(allocated);
  EXPECT_EQ(sum, 1000L + 1999999L * 999L * 1000L / 2 + 2000000001L);
  EXPECT_EQ(lo, 1.5);
}

}  // namespace

#include <qel/curve_fit.h>

namespace {

// Every allocation of the curve fit in turn: 30001 with every output NaN.
TEST(AllocationFailure, CurveFitReportsOutOfMemory) {
  const double x[] = {0.0, 1.0, 2.0, 3.0, 4.0, 5.0}, y[] = {1.0, 2.5, 2.9, 4.2, 5.1, 5.8};
  double c[5], r2 = 0.0;
  const int allocations = failEachAllocation(
      [&] { return qel::v1::RunLynGrCurveFit(c, &r2, x, y, 6, 3, 0.0, true); },
      [&](int k) { EXPECT_TRUE(nan({c[0], c[1], c[2], c[3], c[4], r2})) << "allocation " << k; });
  EXPECT_GT(allocations, 6);  // the column array and five columns at least
  EXPECT_TRUE(std::isfinite(c[3]) && r2 > 0.9);
}

// Merging lambdas: 30001 with both outputs emptied; the exported P-value
// gives the missing value.
TEST(AllocationFailure, ConsolidateLambdas) {
  const double lambdas[] = {0.5, 0.5, 0.2};
  std::vector<double> distinct{1.0};
  std::vector<unsigned> counts{1};
  EXPECT_EQ(failingFirstAllocation(
                [&] { return qel::ConsolidateLambdas(lambdas, 3, distinct, counts); }),
            qel::qelFailOutOfMemory);
  EXPECT_TRUE(distinct.empty() && counts.empty());
  EXPECT_EQ(failingFirstAllocation(
                [&] { return qel::GetStudentizedMaximumModulusPValue(2.0, 10.0, lambdas, 3); }),
            qel::mGetMissingValueCode());
}

}  // namespace
