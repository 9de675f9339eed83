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
#include <functional>
#include <random>
#include <vector>

namespace {

using Fields = std::vector<double>;

// Runs `run` (which returns the code and then every field it wrote) on one
// and on four threads: same code, same fields to a few units in the last
// place (NaN where both leave a field unset). Returns the one-thread run.
Fields expectSameOnOneAndFourThreads(const std::function<Fields()>& run) {
  const int saved = omp_get_max_threads();
  omp_set_num_threads(1);
  const Fields one = run();
  omp_set_num_threads(4);
  const Fields four = run();
  omp_set_num_threads(saved);
  EXPECT_EQ(one.at(0), qel::qelOk);
  EXPECT_EQ(one.size(), four.size());
  for (std::size_t i = 0; i < one.size() && i < four.size(); ++i) {
    EXPECT_TRUE(std::isnan(one[i]) ? std::isnan(four[i])
                                   : std::fabs(one[i] - four[i]) <= 1e-13 * std::fabs(one[i]))
        << "field " << i << ": " << one[i] << " vs " << four[i];
  }
  return one;
}

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

// Group records lending the first `count` samples.
template <class Group>
std::vector<Group> lend(const std::vector<std::vector<double>>& data, std::size_t count) {
  std::vector<Group> groups(count);
  for (std::size_t g = 0; g < count; ++g) {
    groups[g].data = data[g].data();
    groups[g].n = static_cast<unsigned int>(data[g].size());
  }
  return groups;
}

TEST(RankTestThreads, KruskalWallisAgreesOnOneAndFourThreads) {
  const auto data = makeGroups(10, 11);
  const Fields one = expectSameOnOneAndFourThreads([&] {
    auto groups = lend<qel::v0::KruskalWallisGroup>(data, data.size());
    qel::v0::KruskalWallis r;
    r.groups = groups.data();
    r.groupCount = static_cast<unsigned int>(data.size());
    Fields f = {double(qel::v0::RunLynKruskalWallis(&r)), r.adjustedStatistic, r.statistic,
                r.pValue, r.degreesOfFreedom};
    for (const auto& g : groups) f.insert(f.end(), {g.median, g.meanRank, g.z});
    return f;
  });
  EXPECT_TRUE(std::isfinite(one[1]));  // the data have ties
}

// Nine groups through the parallel loops; two groups through the parallel
// sections of the interval of the median difference.
TEST(RankTestThreads, MoodAgreesOnOneAndFourThreads) {
  const auto many = makeGroups(9, 23);
  for (std::size_t count : {many.size(), std::size_t{2}}) {
    const Fields one = expectSameOnOneAndFourThreads([&] {
      auto groups = lend<qel::v0::MoodGroup>(many, count);
      qel::v0::Mood r;
      r.groups = groups.data();
      r.groupCount = static_cast<unsigned int>(count);
      Fields f = {double(qel::v0::RunLynMood(&r)), r.statistic,   double(r.flags),
                  r.overallMedian, r.lowerLimit, r.degreesOfFreedom, r.upperLimit,
                  r.achievedConfidence};
      for (const auto& g : groups)
        f.insert(f.end(), {g.countAtOrBelow, g.countAbove, g.median, g.interquartileRange,
                           g.lowerLimit, g.upperLimit});
      return f;
    });
    EXPECT_GT(one[1], 0.0);
    EXPECT_TRUE(count != 2 || std::isfinite(one[4]));
  }
}

TEST(RankTestThreads, FriedmanAgreesOnOneAndFourThreads) {
  // Seven treatments in 60 blocks with block effects, values rounded.
  std::mt19937_64 engine(37);
  std::normal_distribution<double> normal(0.0, 1.0);
  std::vector<std::vector<double>> table(7, std::vector<double>(60));
  for (int b = 0; b < 60; ++b)
    for (int t = 0; t < 7; ++t)
      table[t][b] = std::round((0.3 * b + 0.2 * t + normal(engine)) * 4) / 4;
  const Fields one = expectSameOnOneAndFourThreads([&] {
    std::vector<std::vector<double>> columns = table;  // fitted values after the run
    std::vector<qel::v0::FriedmanTreatment> treatments(table.size());
    for (std::size_t t = 0; t < table.size(); ++t) treatments[t].column = columns[t].data();
    qel::v0::Friedman r;
    r.treatments = treatments.data();
    r.blocks = 60;
    r.treatmentCount = 7;
    Fields f = {double(qel::v0::RunLynFriedman(&r)), r.adjustedStatistic, r.statistic,
                r.grandMedian};
    for (std::size_t t = 0; t < table.size(); ++t) {
      f.insert(f.end(), {treatments[t].rankSum, treatments[t].estimatedMedian});
      f.insert(f.end(), columns[t].begin(), columns[t].end());
    }
    return f;
  });
  EXPECT_TRUE(std::isfinite(one[1]));  // ties within blocks
}

// Sections write disjoint fields and reduce no sums.
TEST(RankTestThreads, WilcoxonAndRunsSectionsAgreeOnOneAndFourThreads) {
  std::mt19937_64 engine(41);
  std::normal_distribution<double> normal(0.3, 1.0);
  std::vector<double> x(501);
  for (double& v : x) v = std::round(normal(engine) * 8.0) / 8.0;  // ties, and zeros at mu0 = 0
  const Fields one = expectSameOnOneAndFourThreads([&] {
    qel::v0::OneSampleWilcoxon w;
    w.n = static_cast<int>(x.size());
    qel::v1::RunsTest runs;
    const int code = qel::v0::RunLynOneSampleWilcoxon(&w, x.data(), 0.95, qel::kIntervalTwoSided,
                                                      qel::kAlternativeNotEqual, 0.0) +
                     qel::v1::RunRunsTest(&runs, x.data(), 0.25, static_cast<unsigned>(x.size()));
    return Fields{
        double(code),         w.pValue, w.lowerLimit, w.estimatedMedian, w.upperLimit,
        w.achievedConfidence, w.W,      double(w.n),  runs.pValue,       double(runs.observedRuns)};
  });
  EXPECT_TRUE(std::isfinite(one[1]) && std::isfinite(one[2]) && std::isfinite(one[8]));
}

}  // namespace
