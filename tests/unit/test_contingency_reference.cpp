// Contingency table statistics against R and against direct evaluation of
// the defining formulas (tools/reference/gen_contingency_r.R): small, sparse
// (with an empty row and column), large, highly unbalanced and non-integer
// tables, every result requested in one Analyze.
//
// Where the library's definition differs from R's function of the same name,
// the reference is the definition, evaluated by the script:
// - McNemar: mcnemar.test is the asymptotic chi-square test; the library
//   gives the exact binomial P-value (binom.test of the smaller discordant
//   count) and the difference of the marginal proportions with a Wald
//   interval widened by 1/N.
// - Mantel-Haenszel-Cochran: the library always applies the continuity
//   correction of 1/2, so the reference is mantelhaen.test(correct = TRUE)
//   (which agrees whenever |sum of a - E(a)| >= 1/2, true in every case
//   here); correct = FALSE is a different statistic.
// - Tables with one non-empty row or column: chisq.test would test goodness
//   of fit; those are checked by hand in test_contingency_edges.cpp.
#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <string>
#include <vector>

#include "contingency_run.h"
#include "reference_data.h"

namespace {

using qeltest::relativeError;
using qeltest::TableHost;

using Case = std::map<std::string, std::vector<double>>;

std::map<std::string, Case> loadCases() {
  std::map<std::string, Case> cases;
  for (auto const& row : qeltest::loadReferenceData("contingency_r.csv", 2)) {
    if (row.text[0] == "mh_stratum") {
      auto& strata = cases[row.text[1]]["mh_strata"];
      strata.insert(strata.end(), row.numbers.begin() + 1, row.numbers.end());
    } else {
      cases[row.text[1]][row.text[0]] = row.numbers;
    }
  }
  return cases;
}

// Relative error, or absolute error for reference values near 0 (a
// correlation of 0.002 computed from sums of 1e5 is not relatively exact).
double error(double actual, double expected) {
  if (std::fabs(expected) < 1e-3) return std::fabs(actual - expected);
  return relativeError(actual, expected);
}

TableHost runCase(Case const& ref) {
  std::vector<double> const& t = ref.at("table");
  const auto C = static_cast<unsigned>(t[0]), R = static_cast<unsigned>(t[1]);
  TableHost host(C, R, std::vector<double>(t.begin() + 2, t.end()));
  if (ref.count("kappa")) {
    std::vector<double> const& k = ref.at("kappa");
    host.marks.assign(k.begin(), k.end() - 1);
  }
  host.run();
  return host;
}

void expectCells(TableHost const& host, int result, std::vector<double> const& ref,
                 double tolerance, std::string const& what) {
  ASSERT_EQ(ref.size(), static_cast<std::size_t>(host.C) * host.R) << what;
  for (std::size_t i = 0; i < ref.size(); ++i) {
    EXPECT_LT(error(host.cells[result][i], ref[i]), tolerance)
        << what << " cell " << i << ": " << host.cells[result][i] << " vs " << ref[i];
  }
}

TEST(ContingencyReference, ChiSquareFamilyMatchesR) {
  int checked = 0;
  for (auto const& [name, ref] : loadCases()) {
    if (!ref.count("chisq")) continue;
    TableHost host = runCase(ref);
    ASSERT_EQ(host.code, 0) << name;
    std::vector<double> const& chisq = ref.at("chisq");
    EXPECT_LT(relativeError(host.pearson[0], chisq[0]), 1e-13) << name;
    EXPECT_EQ(host.pearson[1], chisq[1]) << name;
    EXPECT_LT(error(host.pearson[2], chisq[2]), 1e-10) << name;
    std::vector<double> const& g = ref.at("gtest");
    EXPECT_LT(relativeError(host.likelihoodRatio[0], g[0]), 1e-11) << name;
    EXPECT_EQ(host.likelihoodRatio[1], g[1]) << name;
    EXPECT_LT(relativeError(host.likelihoodRatio[2], g[2]), 1e-9) << name;
    expectCells(host, 0, ref.at("expected"), 1e-14, name + " expected");
    // o - e cancels in a cell of 25000 with e = 25000 - 0.006: the last bit
    // of e (R's or ours) is then a relative 4e-12 of the residual.
    expectCells(host, 2, ref.at("resid"), 1e-11, name + " standardized residuals");
    expectCells(host, 3, ref.at("stdres"), 1e-11, name + " adjusted residuals");
    // Raw residuals and contributions from R's expected counts and
    // residuals: o - e and ((o - e) / sqrt(e))^2.
    std::vector<double> const& e = ref.at("expected");
    std::vector<double> const& resid = ref.at("resid");
    for (std::size_t i = 0; i < e.size(); ++i) {
      EXPECT_LT(error(host.cells[1][i], host.counts[i] - e[i]), 1e-11) << name << " raw " << i;
      EXPECT_LT(error(host.cells[4][i], resid[i] * resid[i]), 1e-11) << name << " contrib " << i;
    }
    // Cramer's V squared: X^2 / (N (min(C', R') - 1)), from R's statistic.
    double N = 0.0;
    for (double x : host.counts) N += x;
    unsigned Cp = 0, Rp = 0;
    for (unsigned c = 0; c < host.C; ++c) Cp += std::isnan(e[c * host.R]) ? 0 : 1;
    for (unsigned r = 0; r < host.R; ++r) {
      bool any = false;
      for (unsigned c = 0; c < host.C; ++c) any = any || !std::isnan(e[c * host.R + r]);
      Rp += any ? 1 : 0;
    }
    EXPECT_LT(relativeError(host.cramer[0], chisq[0] / (N * (std::min(Cp, Rp) - 1.0))), 1e-13)
        << name;
    ++checked;
  }
  EXPECT_GE(checked, 10);
}

TEST(ContingencyReference, CorrelationsMatchROnTheExpandedData) {
  int checked = 0;
  for (auto const& [name, ref] : loadCases()) {
    if (!ref.count("cor")) continue;
    TableHost host = runCase(ref);
    std::vector<double> const& cor = ref.at("cor");
    EXPECT_LT(error(host.pearsonR[0], cor[0]), 1e-13) << name;
    EXPECT_LT(error(host.spearman[0], cor[1]), 1e-13) << name;
    if (ref.count("kendall")) {
      EXPECT_LT(error(host.concordance[7], ref.at("kendall")[0]), 1e-13) << name;
    }
    ++checked;
  }
  EXPECT_GE(checked, 10);
}

TEST(ContingencyReference, ConcordanceAndGoodmanKruskalMatchTheirDefinitions) {
  for (auto const& [name, ref] : loadCases()) {
    if (!ref.count("conc")) continue;
    TableHost host = runCase(ref);
    std::vector<double> const& conc = ref.at("conc");
    for (int i = 0; i < 8; ++i) {
      EXPECT_LT(error(host.concordance[i], conc[i]), 1e-13) << name << " slot " << i;
    }
    EXPECT_LT(error(host.concordance[8], conc[8]), 1e-9) << name << " P-value";
    std::vector<double> const& gk = ref.at("gk");
    for (int i = 0; i < 4; ++i) {
      // tau of a table with one dominant cell: N P - SU cancels to 3 digits.
      EXPECT_LT(error(host.goodmanKruskal[i], gk[i]), 1e-11) << name << " Goodman-Kruskal " << i;
    }
  }
}

TEST(ContingencyReference, TwoByTwoTestsAndKappa) {
  int fisher = 0, kappa = 0;
  for (auto const& [name, ref] : loadCases()) {
    if (!ref.count("table")) continue;
    TableHost host = runCase(ref);
    if (ref.count("fisher")) {
      EXPECT_LT(relativeError(host.fisher[0], ref.at("fisher")[0]), 1e-9) << name;
      std::vector<double> const& m = ref.at("mcnemar");
      // The bounds use v1::NormalInvCdf(0.975), which is 1.959963984510
      // against qnorm's 1.959963984540: a relative 1.5e-11.
      EXPECT_LT(error(host.mcNemar[0], m[0]), 1e-13) << name;
      for (int i = 1; i < 3; ++i) EXPECT_LT(error(host.mcNemar[i], m[i]), 1e-10) << name << i;
      EXPECT_LT(relativeError(host.mcNemar[3], m[3]), 1e-12) << name;
      ++fisher;
    } else {
      EXPECT_EQ(host.fisher[0], -2.0) << name;
      EXPECT_EQ(host.mcNemar[3], -2.0) << name;
    }
    if (ref.count("kappa")) {
      EXPECT_LT(relativeError(host.kappa[0], ref.at("kappa").back()), 1e-13) << name;
      ++kappa;
    }
  }
  EXPECT_GE(fisher, 3);
  EXPECT_EQ(kappa, 3);
}

TEST(ContingencyReference, TotalsAndPercentagesMatchR) {
  int checked = 0;
  for (auto const& [name, ref] : loadCases()) {
    if (!ref.count("pct")) continue;
    TableHost host = runCase(ref);
    std::vector<double> const& pct = ref.at("pct");
    const std::size_t n = host.counts.size();
    for (std::size_t k = 0; k < 3; ++k) {
      expectCells(host, 5 + static_cast<int>(k),
                  std::vector<double>(pct.begin() + k * n, pct.begin() + (k + 1) * n), 1e-14,
                  name + " percentages " + std::to_string(k));
    }
    std::vector<double> got = host.columnTotals;
    got.insert(got.end(), host.rowTotals.begin(), host.rowTotals.end());
    got.push_back(host.grandTotal[0]);
    for (auto const* v : {&host.columnTotalPercentages, &host.rowTotalPercentages})
      got.insert(got.end(), v->begin(), v->end());
    std::vector<double> const& margins = ref.at("margins");
    ASSERT_EQ(got.size(), margins.size()) << name;
    for (std::size_t i = 0; i < got.size(); ++i)
      EXPECT_LT(error(got[i], margins[i]), 1e-14) << name << " margin " << i;
    ++checked;
  }
  EXPECT_GE(checked, 12);
}

TEST(ContingencyReference, StratifiedMantelHaenszelMatchesR) {
  int checked = 0;
  for (auto const& [name, ref] : loadCases()) {
    if (!ref.count("mh")) continue;
    std::vector<double> const& strata = ref.at("mh_strata");
    std::vector<double> const& mh = ref.at("mh");
    int made = -1;
    qel::IContingencyTable* t = qel::MakeIContingencyTable(2, 2, 0x800000, &made);
    ASSERT_NE(t, nullptr);
    double result[4] = {1.0, 2.0, 3.0, 4.0};
    std::vector<double> stratum(4);
    for (std::size_t k = 0; k + 4 <= strata.size(); k += 4) {
      stratum.assign(strata.begin() + k, strata.begin() + k + 4);
      t->SetupObservedCounts(stratum.data(), 0);
      t->SetupObservedCounts(stratum.data() + 2, 1);
      t->SetupMHCTest(result);
      ASSERT_EQ(t->Analyze(), 0);
    }
    t->FinalizeMHCTest(result);
    qel::DeleteIContingencyTable(&t);
    EXPECT_EQ(t, nullptr);
    EXPECT_LT(relativeError(result[0], mh[0]), 1e-13) << name;
    EXPECT_LT(relativeError(result[1], mh[1]), 1e-12) << name;
    EXPECT_LT(relativeError(result[2], mh[2]), 1e-9) << name;
    EXPECT_EQ(result[3], mh[3]) << name;
    ++checked;
  }
  EXPECT_EQ(checked, 3);
}

}  // namespace
