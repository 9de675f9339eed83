// The parallel loops of Kruskal-Wallis, Mood and Friedman, and the parallel
// sections of the Wilcoxon signed rank and runs tests, give the same
// results on one thread and on four: every group or treatment record is
// written by one thread only, and the reduced sums may differ only in
// rounding. The data hold many ties, so the tie runs and the tie-adjusted
// statistics are exercised as well.
#include <gtest/gtest.h>
#include <omp.h>
#include <qel/rank_tests.h>
#include <qel/sign_tests.h>

#include <cmath>
#include <random>
#include <vector>

namespace {

// Restores the thread count of the process when a test ends.
class ThreadCount {
 public:
  ThreadCount() : saved_(omp_get_max_threads()) {}
  ~ThreadCount() { omp_set_num_threads(saved_); }
  ThreadCount(const ThreadCount&) = delete;
  ThreadCount& operator=(const ThreadCount&) = delete;

 private:
  int saved_;
};

// Groups of unequal sizes and locations, rounded to a tenth to make ties.
std::vector<std::vector<double>> makeGroups(int count, unsigned seed) {
  std::mt19937_64 engine(seed);
  std::vector<std::vector<double>> groups(count);
  for (int g = 0; g < count; ++g) {
    std::normal_distribution<double> normal(0.05 * g, 1.0);
    groups[g].resize(200 + 37 * g);
    for (double& v : groups[g]) v = std::round(normal(engine) * 10.0) / 10.0;
  }
  return groups;
}

// Sums reduced in a different order agree to a few units in the last place.
void expectSameSum(double one, double four) {
  EXPECT_NEAR(one, four, 1e-13 * std::fabs(one));
}

struct KruskalWallisRun {
  qel::v0::KruskalWallis record;
  std::vector<qel::v0::KruskalWallisGroup> groups;
  int code;
};

KruskalWallisRun runKruskalWallis(const std::vector<std::vector<double>>& data, int threads) {
  omp_set_num_threads(threads);
  KruskalWallisRun run;
  run.groups.resize(data.size());
  for (std::size_t g = 0; g < data.size(); ++g) {
    run.groups[g].data = data[g].data();
    run.groups[g].n = static_cast<unsigned int>(data[g].size());
  }
  run.record.groups = run.groups.data();
  run.record.groupCount = static_cast<unsigned int>(data.size());
  run.code = qel::v0::RunLynKruskalWallis(&run.record);
  return run;
}

TEST(RankTestThreads, KruskalWallisAgreesOnOneAndFourThreads) {
  ThreadCount restore;
  const auto data = makeGroups(10, 11);
  const KruskalWallisRun one = runKruskalWallis(data, 1);
  const KruskalWallisRun four = runKruskalWallis(data, 4);
  ASSERT_EQ(one.code, qel::qelOk);
  ASSERT_EQ(four.code, qel::qelOk);
  ASSERT_TRUE(std::isfinite(one.record.adjustedStatistic));  // the data have ties
  expectSameSum(one.record.statistic, four.record.statistic);
  expectSameSum(one.record.adjustedStatistic, four.record.adjustedStatistic);
  EXPECT_NEAR(one.record.pValue, four.record.pValue, 1e-12 * one.record.pValue);
  EXPECT_EQ(one.record.degreesOfFreedom, four.record.degreesOfFreedom);
  for (std::size_t g = 0; g < data.size(); ++g) {
    EXPECT_EQ(one.groups[g].median, four.groups[g].median) << "group " << g;
    EXPECT_EQ(one.groups[g].meanRank, four.groups[g].meanRank) << "group " << g;
    EXPECT_EQ(one.groups[g].z, four.groups[g].z) << "group " << g;
  }
}

// Equal, or both NaN (fields that a test leaves unset).
::testing::AssertionResult same(double a, double b) {
  if (a == b || (std::isnan(a) && std::isnan(b))) return ::testing::AssertionSuccess();
  return ::testing::AssertionFailure() << a << " differs from " << b;
}

struct MoodRun {
  qel::v0::Mood record;
  std::vector<qel::v0::MoodGroup> groups;
  int code;
};

MoodRun runMood(const std::vector<std::vector<double>>& data, int threads) {
  omp_set_num_threads(threads);
  MoodRun run;
  run.groups.resize(data.size());
  for (std::size_t g = 0; g < data.size(); ++g) {
    run.groups[g].data = data[g].data();
    run.groups[g].n = static_cast<unsigned int>(data[g].size());
  }
  run.record.groups = run.groups.data();
  run.record.groupCount = static_cast<unsigned int>(data.size());
  run.code = qel::v0::RunLynMood(&run.record);
  return run;
}

void expectSameMood(const MoodRun& one, const MoodRun& four) {
  EXPECT_EQ(one.code, four.code);
  EXPECT_EQ(one.record.flags, four.record.flags);
  EXPECT_TRUE(same(one.record.overallMedian, four.record.overallMedian));
  expectSameSum(one.record.statistic, four.record.statistic);
  EXPECT_TRUE(same(one.record.degreesOfFreedom, four.record.degreesOfFreedom));
  EXPECT_TRUE(same(one.record.lowerLimit, four.record.lowerLimit));
  EXPECT_TRUE(same(one.record.upperLimit, four.record.upperLimit));
  EXPECT_TRUE(same(one.record.achievedConfidence, four.record.achievedConfidence));
  for (std::size_t g = 0; g < one.groups.size(); ++g) {
    const qel::v0::MoodGroup& a = one.groups[g];
    const qel::v0::MoodGroup& b = four.groups[g];
    EXPECT_TRUE(same(a.countAtOrBelow, b.countAtOrBelow)) << "group " << g;
    EXPECT_TRUE(same(a.countAbove, b.countAbove)) << "group " << g;
    EXPECT_TRUE(same(a.median, b.median)) << "group " << g;
    EXPECT_TRUE(same(a.interquartileRange, b.interquartileRange)) << "group " << g;
    EXPECT_TRUE(same(a.lowerLimit, b.lowerLimit)) << "group " << g;
    EXPECT_TRUE(same(a.upperLimit, b.upperLimit)) << "group " << g;
  }
}

// Nine groups through the parallel loops; two groups through the parallel
// sections of the interval of the median difference.
TEST(RankTestThreads, MoodAgreesOnOneAndFourThreads) {
  ThreadCount restore;
  const auto many = makeGroups(9, 23);
  const MoodRun one = runMood(many, 1);
  ASSERT_EQ(one.code, qel::qelOk);
  ASSERT_GT(one.record.statistic, 0.0);
  expectSameMood(one, runMood(many, 4));

  const std::vector<std::vector<double>> two(many.begin(), many.begin() + 2);
  const MoodRun twoOne = runMood(two, 1);
  ASSERT_TRUE(std::isfinite(twoOne.record.lowerLimit));
  expectSameMood(twoOne, runMood(two, 4));
}

struct FriedmanRun {
  qel::v0::Friedman record;
  std::vector<qel::v0::FriedmanTreatment> treatments;
  std::vector<std::vector<double>> columns;  // fitted values after the run
  int code;
};

FriedmanRun runFriedman(const std::vector<std::vector<double>>& table, int threads) {
  omp_set_num_threads(threads);
  FriedmanRun run;
  run.columns = table;
  run.treatments.resize(table.size());
  for (std::size_t t = 0; t < table.size(); ++t) run.treatments[t].column = run.columns[t].data();
  run.record.treatments = run.treatments.data();
  run.record.blocks = static_cast<unsigned int>(table[0].size());
  run.record.treatmentCount = static_cast<unsigned int>(table.size());
  run.code = qel::v0::RunLynFriedman(&run.record);
  return run;
}

TEST(RankTestThreads, FriedmanAgreesOnOneAndFourThreads) {
  ThreadCount restore;
  // Seven treatments in 60 blocks with block effects, values rounded.
  std::mt19937_64 engine(37);
  std::normal_distribution<double> normal(0.0, 1.0);
  std::vector<std::vector<double>> table(7, std::vector<double>(60));
  for (int b = 0; b < 60; ++b) {
    const double block = 0.3 * b;
    for (int t = 0; t < 7; ++t)
      table[t][b] = std::round((block + 0.2 * t + normal(engine)) * 4) / 4;
  }
  const FriedmanRun one = runFriedman(table, 1);
  const FriedmanRun four = runFriedman(table, 4);
  ASSERT_EQ(one.code, qel::qelOk);
  ASSERT_EQ(four.code, qel::qelOk);
  ASSERT_TRUE(std::isfinite(one.record.adjustedStatistic));  // ties within blocks
  expectSameSum(one.record.statistic, four.record.statistic);
  expectSameSum(one.record.adjustedStatistic, four.record.adjustedStatistic);
  EXPECT_EQ(one.record.grandMedian, four.record.grandMedian);
  for (std::size_t t = 0; t < table.size(); ++t) {
    EXPECT_EQ(one.treatments[t].rankSum, four.treatments[t].rankSum) << "treatment " << t;
    EXPECT_EQ(one.treatments[t].estimatedMedian, four.treatments[t].estimatedMedian)
        << "treatment " << t;
    EXPECT_EQ(one.columns[t], four.columns[t]) << "fitted values of treatment " << t;
  }
}

// Sections write disjoint fields and reduce no sums: bit-identical results.
TEST(RankTestThreads, WilcoxonAndRunsSectionsAgreeOnOneAndFourThreads) {
  ThreadCount restore;
  std::mt19937_64 engine(41);
  std::normal_distribution<double> normal(0.3, 1.0);
  std::vector<double> x(501);
  for (double& v : x) v = std::round(normal(engine) * 8.0) / 8.0;  // ties, and zeros at mu0 = 0
  qel::v0::OneSampleWilcoxon wilcoxon[2];
  qel::v1::RunsTest runs[2];
  for (int i = 0; i < 2; ++i) {
    omp_set_num_threads(i == 0 ? 1 : 4);
    wilcoxon[i].n = static_cast<int>(x.size());
    ASSERT_EQ(qel::v0::RunLynOneSampleWilcoxon(&wilcoxon[i], x.data(), 0.95, qel::kIntervalTwoSided,
                                               qel::kAlternativeNotEqual, 0.0),
              qel::qelOk);
    ASSERT_EQ(qel::v1::RunRunsTest(&runs[i], x.data(), 0.25, static_cast<unsigned>(x.size())),
              qel::qelOk);
  }
  ASSERT_TRUE(std::isfinite(wilcoxon[0].pValue));
  ASSERT_TRUE(std::isfinite(wilcoxon[0].lowerLimit));
  EXPECT_EQ(wilcoxon[0].estimatedMedian, wilcoxon[1].estimatedMedian);
  EXPECT_EQ(wilcoxon[0].achievedConfidence, wilcoxon[1].achievedConfidence);
  EXPECT_EQ(wilcoxon[0].lowerLimit, wilcoxon[1].lowerLimit);
  EXPECT_EQ(wilcoxon[0].upperLimit, wilcoxon[1].upperLimit);
  EXPECT_EQ(wilcoxon[0].W, wilcoxon[1].W);
  EXPECT_EQ(wilcoxon[0].pValue, wilcoxon[1].pValue);
  EXPECT_EQ(wilcoxon[0].n, wilcoxon[1].n);
  ASSERT_TRUE(std::isfinite(runs[0].pValue));
  EXPECT_EQ(runs[0].observedRuns, runs[1].observedRuns);
  EXPECT_EQ(runs[0].pValue, runs[1].pValue);
}

}  // namespace
