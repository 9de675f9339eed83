// Chi-square goodness of fit on a table of counts: against R's chisq.test
// (tools/reference/gen_tabular_gof.R), far tails and an exact sum from
// mpmath (tools/reference/gen_tabular_gof_tail.py), aliasing and edges.
#include <gtest/gtest.h>
#include <qel/tabular_gof.h>

#include <cmath>
#include <map>
#include <numeric>
#include <sstream>
#include <string>
#include <vector>

#include "reference_data.h"

namespace {

using qeltest::relativeError;

struct Gof {
  std::vector<double> expected, contributions;
  double statistic = 0, p = 0, df = 0;
  int code = -1;
  Gof(const std::vector<double>& x, const double* props, double total)
      : expected(x.size()), contributions(x.size()) {
    code = qel::RunLynTabularChiSqGOFTest(x.data(), props, expected.data(), contributions.data(),
                                          &statistic, &p, &df, total, unsigned(x.size()));
  }
};

std::vector<double> split(const std::string& s) {  // "a;b;c"
  std::vector<double> v;
  std::stringstream in(s);
  for (std::string item; std::getline(in, item, ';');) v.push_back(std::stod(item));
  return v;
}

double sum(const std::vector<double>& x) {
  return std::accumulate(x.begin(), x.end(), 0.0);
}

TEST(TabularChiSqGof, MatchesRChisqTest) {
  // Per case: observed, proportions, expected, squared residuals.
  std::map<int, std::vector<double>> cell[4], cases;
  for (const auto& row : qeltest::loadReferenceData("tabular_gof_r.csv", 1)) {
    const int id = int(row.numbers[0]);
    if (row.text[0] == "case") cases[id] = row.numbers;
    for (int j = 0; j < 4 && row.text[0] == "cell"; ++j) cell[j][id].push_back(row.numbers[1 + j]);
  }
  ASSERT_EQ(cases.size(), 9u);
  for (const auto& c : cases) {
    const int id = c.first;
    const Gof r(cell[0][id], c.second[2] == 1 ? nullptr : cell[1][id].data(), sum(cell[0][id]));
    EXPECT_TRUE(r.code == 0 && r.df == c.second[1] - 1);
    EXPECT_LE(relativeError(r.statistic, c.second[3]), 1e-12) << id;
    EXPECT_LE(c.second[4] > 1e-290 ? relativeError(r.p, c.second[4]) : r.p, 1e-12) << id;
    for (std::size_t i = 0; i < cell[0][id].size(); ++i) {
      EXPECT_LE(relativeError(r.expected[i], cell[2][id][i]), 1e-13) << id << " " << i;
      EXPECT_LE(std::fabs(r.contributions[i] - cell[3][id][i]),
                1e-10 * cell[3][id][i] + 1e-13 * r.statistic)
          << id << " " << i;
    }
  }
}

TEST(TabularChiSqGof, FarTailsAndCompensatedSumMatchMpmath) {
  int tails = 0;
  for (const auto& row : qeltest::loadReferenceData("tabular_gof_mpmath.csv", 3)) {
    if (row.text[0] == "sum") {
      // One statistic of 2.4e16 (ulp 4) and a million contributions of 1/3:
      // added one by one they vanish, 1.4e-11 of the sum.
      std::vector<double> x(std::stoul(row.text[1]), row.numbers[1]);
      x[0] = row.numbers[0];
      const Gof r(x, nullptr, std::stod(row.text[2]));
      double plain = 0;
      for (double c : r.contributions) plain += c;
      EXPECT_GT(relativeError(plain, row.numbers[2]), 1e-12);
      EXPECT_LE(relativeError(r.statistic, row.numbers[2]), 1e-15);
      continue;
    }
    ++tails;
    const std::vector<double> x = split(row.text[1]);
    const std::vector<double> p = row.text[2] == "-" ? x : split(row.text[2]);
    const Gof r(x, row.text[2] == "-" ? nullptr : p.data(), sum(x));
    EXPECT_LE(relativeError(r.statistic, row.numbers[0]), 1e-13) << row.line;
    // Below the underflow threshold: 0.
    EXPECT_LE(row.numbers[1] > 1e-300 ? relativeError(r.p, row.numbers[1]) : r.p, 1e-12);
  }
  EXPECT_EQ(tails, 10);
}

TEST(TabularChiSqGof, OutputsMayOverwriteInputs) {
  const std::vector<double> x = {12, 30, 7, 51}, p = {0.1, 0.3, 0.2, 0.4};
  const Gof ref(x, p.data(), 100);
  std::vector<double> inPlace = x, props = p;
  double s, pv, df;
  // expected over observed, contributions over proportions.
  qel::RunLynTabularChiSqGOFTest(inPlace.data(), props.data(), inPlace.data(), props.data(), &s,
                                 &pv, &df, 100, 4);
  EXPECT_TRUE(inPlace == ref.expected && props == ref.contributions && s == ref.statistic);
}

TEST(TabularChiSqGof, Edges) {
  const Gof equal({10, 20, 30, 40}, nullptr, 100);
  EXPECT_TRUE(equal.expected == std::vector<double>(4, 25.0) && Gof({7}, nullptr, 7).df == 0);
  // Proportions and total taken as given: e = {20, 10}, contributions 5 and
  // 10, P(chi2(1) > 15) = erfc(sqrt(7.5)).
  const double half[] = {0.5, 0.25};
  const Gof given({10, 20}, half, 40);
  EXPECT_TRUE(given.expected == (std::vector<double>{20, 10}) && given.statistic == 15);
  EXPECT_LE(relativeError(given.p, 1.07511176729500563e-4), 1e-13);
  // An expected count of 0: infinite contribution, or NaN when the count is
  // 0 too; the code stays 0 and the P-value follows the statistic.
  const double zero[] = {0.0, 1.0};
  const Gof inf({3, 7}, zero, 10), nan({0, 10}, zero, 10);
  EXPECT_TRUE(std::isinf(inf.statistic) && inf.p == 0 && inf.code == 0);
  EXPECT_TRUE(std::isnan(nan.contributions[0]) && std::isnan(nan.statistic) && std::isnan(nan.p) &&
              nan.code == 0);
  const Gof none({}, nullptr, 0);
  EXPECT_TRUE(none.code == 0 && none.statistic == 0 && none.df == -1 && std::isnan(none.p));
}

}  // namespace
