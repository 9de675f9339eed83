// Rank tests against R (tools/reference/gen_rank_tests.R) and, for the
// Hodges-Lehmann shift and its limits, against all pairwise differences.
#include <gtest/gtest.h>
#include <qel/rank_tests.h>

#include <algorithm>
#include <cmath>
#include <map>
#include <random>
#include <string>
#include <vector>

#include "interfaces/basic_statistics/sign_interval.h"
#include "reference_data.h"

namespace {

struct Cases {
  std::map<std::string, std::map<std::string, std::vector<double>>> byCase;
};

Cases loadCases() {
  Cases cases;
  for (auto const& row : qeltest::loadReferenceData("rank_tests_r.csv", 2)) {
    cases.byCase[row.text[1]][row.text[0]] = row.numbers;
  }
  return cases;
}

// All differences x[i] - y[j], sorted.
std::vector<double> allDifferences(std::vector<double> const& x, std::vector<double> const& y) {
  std::vector<double> d;
  for (double a : x)
    for (double b : y) d.push_back(a - b);
  std::sort(d.begin(), d.end());
  return d;
}

double median(std::vector<double> d) {
  std::sort(d.begin(), d.end());
  std::size_t n = d.size();
  return n % 2 ? d[n / 2] : 0.5 * (d[n / 2 - 1] + d[n / 2]);
}

// Runs `check` on every case holding the row `tag`, which must be `expected` cases.
template <class Check>
void forEachCase(const char* tag, int expected, Check check) {
  int checked = 0;
  for (auto const& [name, rows] : loadCases().byCase) {
    if (!rows.count(tag)) continue;
    check(name, rows, rows.at(tag));
    ++checked;
  }
  EXPECT_EQ(checked, expected) << tag;
}

int runMannWhitney(qel::v0::MannWhitney& r, std::vector<double> const& x,
                   std::vector<double> const& y, double confidence, int type, int alternative) {
  r.firstN = static_cast<int>(x.size());
  r.secondN = static_cast<int>(y.size());
  return qel::v0::RunLynMannWhitney(&r, x.data(), y.data(), confidence,
                                    static_cast<qel::IntervalType>(type),
                                    static_cast<qel::AlternativeHypothesis>(alternative));
}

}  // namespace

TEST(MannWhitney, MatchesR) {
  forEachCase("mw", 9, [](std::string const& name, auto const& rows,
                           std::vector<double> const& ref) {
    std::vector<double> const& x = rows.at("mw_x");
    std::vector<double> const& y = rows.at("mw_y");
    qel::v0::MannWhitney r;
    ASSERT_EQ(runMannWhitney(r, x, y, ref[1], int(ref[2]), int(ref[0])), 0) << name;
    EXPECT_EQ(r.statistic, ref[3]) << name;
    const bool ties = ref[5] != 0.0;
    EXPECT_LT(qeltest::relativeError(ties ? r.adjustedPValue : r.pValue, ref[4]), 1e-9) << name;
    if (!ties) { EXPECT_EQ(r.adjustedPValue, -1.0) << name; }
    EXPECT_NEAR(r.estimate, ref[6], 1e-12) << name;
    EXPECT_NEAR(r.lowerLimit, ref[7], 1e-12) << name;
    EXPECT_NEAR(r.upperLimit, ref[8], 1e-12) << name;
    EXPECT_DOUBLE_EQ(r.firstMedian, median(x)) << name;
    EXPECT_DOUBLE_EQ(r.secondMedian, median(y)) << name;
    EXPECT_GT(r.achievedConfidence, ref[1] - 0.02) << name;
  });
}

// Random sizes, with and without heavy ties, one- and two-sided: the shift
// is the median of all differences and the limits are order statistics of
// them, with the same rank from each end.
TEST(MannWhitney, ShiftAndLimitsAgreeWithAllDifferences) {
  std::mt19937 rng(5);
  std::normal_distribution<double> normal;
  for (int trial = 0; trial < 40; ++trial) {
    const bool rounded = trial % 2 == 1;
    std::vector<double> x(2 + rng() % 30), y(2 + rng() % 30);
    for (double& v : x) v = rounded ? std::round(2 * normal(rng)) : normal(rng) + 0.4;
    for (double& v : y) v = rounded ? std::round(2 * normal(rng)) : normal(rng);
    std::vector<double> d = allDifferences(x, y);
    const std::size_t N = d.size();
    qel::v0::MannWhitney two, lower, upper;
    if (runMannWhitney(two, x, y, 0.9, 0, 0) != 0) continue;  // a constant rounded sample
    ASSERT_EQ(runMannWhitney(upper, x, y, 0.9, -1, 0), 0);
    ASSERT_EQ(runMannWhitney(lower, x, y, 0.9, 1, 0), 0);
    EXPECT_NEAR(two.estimate, median(d), 1e-12) << trial;
    EXPECT_EQ(two.estimate, upper.estimate);
    // The two-sided limits are symmetric in rank.
    auto upperRank =
        std::count_if(d.begin(), d.end(), [&](double v) { return v < two.upperLimit - 1e-9; });
    auto lowerRank =
        std::count_if(d.begin(), d.end(), [&](double v) { return v <= two.lowerLimit + 1e-9; });
    EXPECT_TRUE(std::any_of(d.begin(), d.end(),
                            [&](double v) { return std::fabs(v - two.lowerLimit) < 1e-12; }));
    EXPECT_LE(two.lowerLimit, two.estimate);
    EXPECT_GE(two.upperLimit, two.estimate);
    if (!rounded) { EXPECT_EQ(std::size_t(lowerRank), N - std::size_t(upperRank)) << trial; }
    // One-sided limits sit further in than the two-sided ones at the same
    // confidence and the other side is infinite.
    EXPECT_EQ(upper.lowerLimit, -INFINITY);
    EXPECT_EQ(lower.upperLimit, INFINITY);
    EXPECT_LE(upper.upperLimit, two.upperLimit);
    EXPECT_GE(lower.lowerLimit, two.lowerLimit);
  }
}

TEST(MannWhitney, DegenerateAndBadInput) {
  std::vector<double> constant(6, 2.5), varying{1, 2, 3, 4, 5};
  qel::v0::MannWhitney r;
  EXPECT_EQ(runMannWhitney(r, constant, varying, 0.95, 0, 0), 30023);
  EXPECT_TRUE(std::isnan(r.statistic) && std::isnan(r.estimate) && std::isnan(r.firstMedian));
  EXPECT_EQ(runMannWhitney(r, varying, constant, 0.95, 0, 0), 30023);
  // Values differing by less than the tolerance count as one value.
  std::vector<double> nearly{1.0, 1.0 + 1e-14, 1.0 - 1e-14};
  EXPECT_EQ(runMannWhitney(r, nearly, varying, 0.95, 0, 0), 30023);
  EXPECT_EQ(runMannWhitney(r, varying, varying, 0.95, 2, 0), 30002);
  EXPECT_TRUE(std::isnan(r.lowerLimit) && std::isnan(r.pValue));
  EXPECT_EQ(runMannWhitney(r, varying, varying, 0.95, 0, -2), 30002);
  EXPECT_TRUE(std::isnan(r.statistic));
}

namespace {

// Lends each sample to a group record and runs the test.
template <class Record, class Group>
int runGroups(Record& r, std::vector<std::vector<double>> const& data, std::vector<Group>& groups,
              int (*run)(Record*)) {
  groups.assign(data.size(), Group{});
  for (std::size_t g = 0; g < data.size(); ++g) {
    groups[g].data = data[g].data();
    groups[g].n = static_cast<unsigned int>(data[g].size());
  }
  r.groups = groups.data();
  r.groupCount = static_cast<unsigned int>(groups.size());
  return run(&r);
}

int runMood(qel::v0::Mood& r, std::vector<std::vector<double>> const& data,
            std::vector<qel::v0::MoodGroup>& groups) {
  return runGroups(r, data, groups, qel::v0::RunLynMood);
}

// The samples prefix1, prefix2, ... of a case.
std::vector<std::vector<double>> numbered(std::map<std::string, std::vector<double>> const& rows,
                                          std::string const& prefix) {
  std::vector<std::vector<double>> data;
  for (int i = 1; rows.count(prefix + std::to_string(i)); ++i)
    data.push_back(rows.at(prefix + std::to_string(i)));
  return data;
}

}  // namespace

TEST(KruskalWallis, MatchesR) {
  forEachCase("kw", 3, [](std::string const& name, auto const& rows,
                           std::vector<double> const& ref) {
    std::vector<std::vector<double>> data = numbered(rows, "kw_g");
    qel::v0::KruskalWallis r;
    std::vector<qel::v0::KruskalWallisGroup> groups;
    ASSERT_EQ(runGroups(r, data, groups, qel::v0::RunLynKruskalWallis), 0) << name;
    const bool ties = ref[3] != 0.0;
    EXPECT_LT(qeltest::relativeError(ties ? r.adjustedStatistic : r.statistic, ref[0]), 1e-12)
        << name;
    EXPECT_EQ(r.degreesOfFreedom, ref[1]);
    EXPECT_LT(qeltest::relativeError(ties ? r.adjustedPValue : r.pValue, ref[2]), 1e-9) << name;
    if (ties) {
      EXPECT_LT(r.statistic, r.adjustedStatistic) << name;
    } else {
      EXPECT_TRUE(std::isnan(r.adjustedStatistic)) << name;
      EXPECT_EQ(r.adjustedPValue, -1.0) << name;
    }
    // The mean ranks average to (N + 1) / 2; the medians are those of the data.
    double N = 0.0, rankTotal = 0.0;
    for (std::size_t g = 0; g < data.size(); ++g) {
      EXPECT_EQ(groups[g].median, median(data[g])) << name << " group " << g;
      N += double(data[g].size());
      rankTotal += groups[g].meanRank * double(data[g].size());
    }
    EXPECT_NEAR(rankTotal, N * (N + 1) / 2, 1e-9) << name;
  });
}

TEST(KruskalWallis, OneGroupHasNoDegreesOfFreedom) {
  std::vector<std::vector<double>> data{{3.0, 1.0, 2.0, 5.0}};
  qel::v0::KruskalWallis r;
  std::vector<qel::v0::KruskalWallisGroup> groups;
  EXPECT_EQ(runGroups(r, data, groups, qel::v0::RunLynKruskalWallis), 0);
  EXPECT_EQ(r.degreesOfFreedom, 0.0);
  EXPECT_EQ(r.statistic, 0.0);
  EXPECT_EQ(groups[0].median, 2.5);
  EXPECT_EQ(groups[0].meanRank, 2.5);
}

TEST(Mood, MatchesR) {
  forEachCase("md", 3, [](std::string const& name, auto const& rows,
                           std::vector<double> const& ref) {
    std::vector<std::vector<double>> data = numbered(rows, "md_g");
    qel::v0::Mood r;
    std::vector<qel::v0::MoodGroup> groups;
    ASSERT_EQ(runMood(r, data, groups), 0) << name;
    EXPECT_EQ(r.overallMedian, ref[0]) << name;
    EXPECT_LT(qeltest::relativeError(r.statistic, ref[1]), 1e-12) << name;
    EXPECT_EQ(r.degreesOfFreedom, ref[2]) << name;
    EXPECT_LT(qeltest::relativeError(r.pValue, ref[3]), 1e-9) << name;
    for (std::size_t g = 0; g < data.size(); ++g) {
      std::vector<double> const& s = rows.at("md_s" + std::to_string(g + 1));
      EXPECT_EQ(groups[g].median, s[0]) << name << g;
      EXPECT_NEAR(groups[g].interquartileRange, s[1], 1e-13) << name << g;
      EXPECT_EQ(groups[g].countAtOrBelow, s[2]) << name << g;
      EXPECT_EQ(groups[g].countAbove, s[3]) << name << g;
      EXPECT_LE(groups[g].lowerLimit, groups[g].median);
      EXPECT_GE(groups[g].upperLimit, groups[g].median);
    }
    if (data.size() == 2) {
      EXPECT_LE(r.lowerLimit, groups[0].median - groups[1].median) << name;
      EXPECT_GE(r.upperLimit, groups[0].median - groups[1].median) << name;
      EXPECT_NEAR(r.achievedConfidence, 0.95, 1e-12) << name;
    } else {
      EXPECT_TRUE(std::isnan(r.lowerLimit) && std::isnan(r.achievedConfidence)) << name;
    }
  });
}

// n = 5 cannot reach 95%: the whole range. A confidence equal to the
// coverage of [x(2), x(9)] for n = 10, 1 - 22/1024, gives exactly those
// order statistics.
TEST(Mood, SignIntervalLimits) {
  std::vector<std::vector<double>> data{{4, 1, 5, 3, 2}, {10, 2, 8, 6, 4, 1, 9, 3, 7, 5}};
  qel::v0::Mood r;
  std::vector<qel::v0::MoodGroup> groups;
  runMood(r, data, groups);
  EXPECT_EQ(groups[0].lowerLimit, 1.0);
  EXPECT_EQ(groups[0].upperLimit, 5.0);
  unsigned int d = 0;
  double lambda = -1.0;
  qel::v0::Sint(10, 1.0 - 22.0 / 1024.0, &d, &lambda);
  EXPECT_EQ(d, 1u);
  EXPECT_NEAR(lambda, 1.0, 1e-12);
  qel::v0::Sint(5, 0.95, &d, &lambda);
  EXPECT_EQ(d, 1u);
  EXPECT_EQ(lambda, 0.0);
}

TEST(Mood, FlagsAndSingletonGroups) {
  // Most values tie at the median on the low side: they move up, flag 16.
  std::vector<std::vector<double>> tied{{1, 2, 2, 2, 2}, {2, 2, 2, 3}, {2, 2, 0}};
  qel::v0::Mood r;
  std::vector<qel::v0::MoodGroup> groups;
  EXPECT_EQ(runMood(r, tied, groups), 10000);
  EXPECT_TRUE(r.flags & qel::v0::kMoodTiesMovedUp);
  EXPECT_EQ(groups[0].countAtOrBelow, 1.0);  // only the 1 is clearly below
  EXPECT_EQ(groups[0].countAbove, 4.0);
  EXPECT_FALSE(std::isnan(r.statistic));
  // A group of one is counted and described but adds no degree of freedom.
  std::vector<std::vector<double>> single{{1.5, 2.5, 3.5, 0.5}, {4.0}, {0.2, 3.1, 2.2}};
  EXPECT_EQ(runMood(r, single, groups), 0);
  EXPECT_EQ(r.degreesOfFreedom, 1.0);
  EXPECT_EQ(groups[1].median, 4.0);
  EXPECT_EQ(groups[1].countAbove, 1.0);
  // One group only: no degrees of freedom, flag 8.
  std::vector<std::vector<double>> one{{1, 2, 3, 4, 5, 6}};
  EXPECT_EQ(runMood(r, one, groups), 10000);
  EXPECT_TRUE(r.flags & qel::v0::kMoodNoDegrees);
}

namespace {

int runFriedman(qel::v0::Friedman& r, std::vector<std::vector<double>>& columns,
                std::vector<qel::v0::FriedmanTreatment>& treatments) {
  treatments.clear();
  for (auto& c : columns) {
    qel::v0::FriedmanTreatment t{};
    t.column = c.data();
    treatments.push_back(t);
  }
  r.treatments = treatments.data();
  r.treatmentCount = static_cast<unsigned int>(treatments.size());
  r.blocks = static_cast<unsigned int>(columns[0].size());
  return qel::v0::RunLynFriedman(&r);
}

}  // namespace

TEST(Friedman, MatchesR) {
  forEachCase("fr", 3, [](std::string const& name, auto const& rows,
                           std::vector<double> const& ref) {
    std::vector<std::vector<double>> columns = numbered(rows, "fr_t");
    qel::v0::Friedman r;
    std::vector<qel::v0::FriedmanTreatment> treatments;
    ASSERT_EQ(runFriedman(r, columns, treatments), 0) << name;
    const bool ties = ref[3] != 0.0;
    EXPECT_LT(qeltest::relativeError(ties ? r.adjustedStatistic : r.statistic, ref[0]), 1e-12)
        << name;
    EXPECT_EQ(r.degreesOfFreedom, ref[1]) << name;
    EXPECT_LT(qeltest::relativeError(ties ? r.adjustedPValue : r.pValue, ref[2]), 1e-9) << name;
    if (ties) {
      EXPECT_GT(r.adjustedPValue, 0.0) << name;
    } else {
      EXPECT_TRUE(std::isnan(r.adjustedStatistic)) << name;
      EXPECT_EQ(r.adjustedPValue, -1.0) << name;
    }
    double rankTotal = 0.0;
    for (auto const& t : treatments) rankTotal += t.rankSum;
    const double k = double(columns.size()), b = double(columns[0].size());
    EXPECT_EQ(rankTotal, b * k * (k + 1) / 2) << name;
  });
}

// An exactly additive table x_i[t] = a_i + c_t: the effects recover a_i
// up to a constant, the fitted values are the data themselves and the
// estimated medians are a_i + median(c).
TEST(Friedman, AdditiveTableIsFittedExactly) {
  const std::vector<double> a{0.0, 1.5, -2.0, 4.0};
  const std::vector<double> c{10.0, 12.0, 7.0, 30.0, 8.0};  // median 10
  std::vector<std::vector<double>> columns(a.size());
  for (std::size_t i = 0; i < a.size(); ++i)
    for (double block : c) columns[i].push_back(a[i] + block);
  std::vector<std::vector<double>> original = columns;
  qel::v0::Friedman r;
  std::vector<qel::v0::FriedmanTreatment> treatments;
  ASSERT_EQ(runFriedman(r, columns, treatments), 0);
  for (std::size_t i = 0; i < a.size(); ++i) {
    EXPECT_NEAR(treatments[i].estimatedMedian, a[i] + 10.0, 1e-12) << i;
    for (std::size_t t = 0; t < c.size(); ++t)
      EXPECT_NEAR(columns[i][t], original[i][t], 1e-12) << i << " " << t;
  }
  // Every block ranks the treatments alike: S = b (k - 1), no ties.
  EXPECT_DOUBLE_EQ(r.statistic, 5.0 * 3.0);
  EXPECT_EQ(r.adjustedPValue, -1.0);
  EXPECT_NEAR(r.grandMedian, 10.0 + (0.0 + 1.5 - 2.0 + 4.0) / 4.0, 1e-12);
}
