// table mode: a two-way table of counts (one table row a line, whitespace
// between the counts) through IContingencyTable, with the requested results
// written one "name value" a line; cell results one line per table row,
// "name row value...". The 2 x 2 tests print NaN for a table of another shape.
#include "table_mode.h"

#include <qel/contingency_table.h>

#include <cmath>
#include <fstream>
#include <iostream>
#include <limits>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "cli.h"

namespace qelcalc {

namespace {

// A table read by rows, stored by column as the library holds it.
struct Table {
  unsigned columns = 0;
  unsigned rows = 0;
  std::vector<double> counts;  // column by column

  double* column(unsigned c) { return counts.data() + static_cast<std::size_t>(c) * rows; }
};

Table readTable(const std::string& path) {
  std::ifstream file;
  std::istream* in = &openInput(path, file);
  std::vector<std::vector<double>> byRow;
  std::string text;
  int lineNumber = 0;
  while (std::getline(*in, text)) {
    ++lineNumber;
    std::istringstream words(text);
    std::vector<double> row;
    std::string word;
    const std::string where = "line " + std::to_string(lineNumber);
    while (words >> word) {
      const double x = parseNumber(word, where);
      if (!(x >= 0.0) || std::isinf(x)) {
        throw UsageError(where + ": a count must be finite and not negative: '" + word + "'");
      }
      row.push_back(x);
    }
    if (row.empty()) continue;
    if (!byRow.empty() && row.size() != byRow.front().size()) {
      throw UsageError(where + ": " + std::to_string(row.size()) +
                       " counts where the first row has " + std::to_string(byRow.front().size()) +
                       " (a table must be rectangular)");
    }
    byRow.push_back(row);
  }
  if (byRow.empty()) throw UsageError("no counts in '" + path + "'");
  if (byRow.size() * byRow.front().size() > std::numeric_limits<unsigned>::max()) {
    throw UsageError("too many counts");
  }
  Table t;
  t.rows = static_cast<unsigned>(byRow.size());
  t.columns = static_cast<unsigned>(byRow.front().size());
  t.counts.resize(static_cast<std::size_t>(t.rows) * t.columns);
  for (unsigned r = 0; r < t.rows; ++r) {
    for (unsigned c = 0; c < t.columns; ++c) t.column(c)[r] = byRow[r][c];
  }
  return t;
}

// The names of --want and their mask bits.
struct Request {
  const char* name;
  unsigned bit;
};
const Request kRequests[] = {
    {"expected", qel::kTableExpectedCounts},
    {"residuals", qel::kTableRawResiduals},
    {"standardized", qel::kTableStandardizedResiduals},
    {"adjusted", qel::kTableAdjustedResiduals},
    {"contributions", qel::kTableChisquareContributions},
    {"colpct", qel::kTableColumnPercentages},
    {"rowpct", qel::kTableRowPercentages},
    {"pct", qel::kTablePercentages},
    {"coltotals", qel::kTableColumnTotals},
    {"rowtotals", qel::kTableRowTotals},
    {"coltotalpct", qel::kTableColumnTotalPercentages},
    {"rowtotalpct", qel::kTableRowTotalPercentages},
    {"total", qel::kTableGrandTotal},
    {"chisq", qel::kTablePearsonChisquare},
    {"lr", qel::kTableLikelihoodRatio},
    {"fisher", qel::kTableFisherExact},
    {"mcnemar", qel::kTableMcNemar},
    {"cramer", qel::kTableCramerVSquare},
    {"kappa", qel::kTableKappa},
    {"pearson", qel::kTablePearsonR},
    {"spearman", qel::kTableSpearmanRho},
    {"gk", qel::kTableGoodmanKruskal},
    {"concordance", qel::kTableMeasuresOfConcordance},
    {"mhc", qel::kTableMHCTest},
};

unsigned maskOf(const Arguments& args) {
  const auto it = args.options.find("want");
  const std::string list = it == args.options.end() ? "chisq" : it->second;
  unsigned mask = 0;
  std::stringstream s(list);
  std::string name;
  while (std::getline(s, name, ',')) {
    if (name == "all") {
      mask |= 0xFFFFFF;
      continue;
    }
    bool known = false;
    for (const Request& r : kRequests) {
      if (name == r.name) {
        mask |= r.bit;
        known = true;
      }
    }
    if (!known) throw UsageError("--want: unknown result '" + name + "'");
  }
  if (mask == 0) throw UsageError("--want names no result");
  return mask;
}

// The caller-owned buffers of every result.
struct Results {
  std::vector<double> cells[8];
  std::vector<double> columnTotals, rowTotals, columnTotalPct, rowTotalPct, marks;
  double total[1], chisq[3], lr[3], fisher[1], mcnemar[4], cramer[1], kappa[1], pearson[1],
      spearman[1], gk[4], concordance[9], mhc[4];
};

void lend(qel::IContingencyTable* t, Table& table, Results& res, unsigned mask) {
  using Setup = void (qel::IContingencyTable::*)(double*, unsigned);
  const Setup columnWise[8] = {&qel::IContingencyTable::SetupExpectedCounts,
                               &qel::IContingencyTable::SetupRawResiduals,
                               &qel::IContingencyTable::SetupStandardizedResiduals,
                               &qel::IContingencyTable::SetupAdjustedResiduals,
                               &qel::IContingencyTable::SetupChisquareContributions,
                               &qel::IContingencyTable::SetupColumnPercentages,
                               &qel::IContingencyTable::SetupRowPercentages,
                               &qel::IContingencyTable::SetupPercentages};
  const unsigned C = table.columns, R = table.rows;
  for (unsigned c = 0; c < C; ++c) t->SetupObservedCounts(table.column(c), c);
  for (int k = 0; k < 8; ++k) {
    if ((mask & (1u << k)) == 0) continue;
    res.cells[k].assign(static_cast<std::size_t>(C) * R, 0.0);
    for (unsigned c = 0; c < C; ++c) (t->*columnWise[k])(res.cells[k].data() + c * R, c);
  }
  res.columnTotals.assign(C, 0.0);
  res.columnTotalPct.assign(C, 0.0);
  res.rowTotals.assign(R, 0.0);
  res.rowTotalPct.assign(R, 0.0);
  // Cohen's kappa pairs level i of the rows with level i of the columns.
  res.marks.assign(C < R ? C : R, 0.0);
  t->SetupColumnTotals(res.columnTotals.data());
  t->SetupRowTotals(res.rowTotals.data());
  t->SetupColumnTotalPercentages(res.columnTotalPct.data());
  t->SetupRowTotalPercentages(res.rowTotalPct.data());
  t->SetupGrandTotal(res.total);
  t->SetupPearsonChisquareTest(res.chisq);
  t->SetupLikelihoodRatioTest(res.lr);
  t->SetupFisherExactTest(res.fisher);
  t->SetupMcNemarTest(res.mcnemar);
  t->SetupCramerVSquare(res.cramer);
  t->SetupKappa(res.marks.data(), res.kappa, static_cast<unsigned>(res.marks.size()));
  t->SetupPearsonR(res.pearson);
  t->SetupSpearmanRho(res.spearman);
  t->SetupGoodmanKruskal(res.gk);
  t->SetupMeasuresOfConcordance(res.concordance);
  if ((mask & qel::kTableMHCTest) != 0) t->SetupMHCTest(res.mhc);
}

// The -2.0 of a 2 x 2 test on a table of another shape reads as NaN here.
std::string value(double x, bool shapeMark = false) {
  if (shapeMark && x == -2.0) return formatNumber(std::numeric_limits<double>::quiet_NaN());
  return formatNumber(x);
}

void lines(std::ostream& out, unsigned mask, unsigned bit, std::vector<const char*> const& names,
           double const* values, int shapeSlot = -1) {
  if ((mask & bit) == 0) return;
  for (std::size_t i = 0; i < names.size(); ++i) {
    out << names[i] << " " << value(values[i], static_cast<int>(i) == shapeSlot) << "\n";
  }
}

void vectorLine(std::ostream& out, unsigned mask, unsigned bit, const char* name,
                std::vector<double> const& v) {
  if ((mask & bit) == 0) return;
  out << name;
  for (double x : v) out << " " << formatNumber(x);
  out << "\n";
}

void print(std::ostream& out, Table const& table, Results const& res, unsigned mask) {
  for (int k = 0; k < 8; ++k) {
    if ((mask & (1u << k)) == 0) continue;
    for (unsigned r = 0; r < table.rows; ++r) {
      out << kRequests[k].name << " " << r + 1;
      for (unsigned c = 0; c < table.columns; ++c) {
        out << " " << formatNumber(res.cells[k][static_cast<std::size_t>(c) * table.rows + r]);
      }
      out << "\n";
    }
  }
  vectorLine(out, mask, qel::kTableColumnTotals, "column_totals", res.columnTotals);
  vectorLine(out, mask, qel::kTableRowTotals, "row_totals", res.rowTotals);
  vectorLine(out, mask, qel::kTableColumnTotalPercentages, "column_total_pct", res.columnTotalPct);
  vectorLine(out, mask, qel::kTableRowTotalPercentages, "row_total_pct", res.rowTotalPct);
  lines(out, mask, qel::kTableGrandTotal, {"total"}, res.total);
  lines(out, mask, qel::kTablePearsonChisquare, {"chisq", "chisq_df", "chisq_p"}, res.chisq);
  lines(out, mask, qel::kTableLikelihoodRatio, {"lr", "lr_df", "lr_p"}, res.lr);
  lines(out, mask, qel::kTableFisherExact, {"fisher_p"}, res.fisher, 0);
  lines(out, mask, qel::kTableMcNemar,
        {"mcnemar_estimate", "mcnemar_lower", "mcnemar_upper", "mcnemar_p"}, res.mcnemar, 3);
  lines(out, mask, qel::kTableCramerVSquare, {"cramer_v2"}, res.cramer);
  lines(out, mask, qel::kTableKappa, {"kappa"}, res.kappa);
  lines(out, mask, qel::kTablePearsonR, {"pearson_r"}, res.pearson);
  lines(out, mask, qel::kTableSpearmanRho, {"spearman_rho"}, res.spearman);
  lines(out, mask, qel::kTableGoodmanKruskal,
        {"lambda_rows_given_columns", "lambda_columns_given_rows", "tau_rows_given_columns",
         "tau_columns_given_rows"},
        res.gk);
  lines(out, mask, qel::kTableMeasuresOfConcordance,
        {"concordant", "discordant", "tied", "pairs", "somers_d_rows", "somers_d_columns", "gamma",
         "tau_b", "concordance_p"},
        res.concordance);
  lines(out, mask, qel::kTableMHCTest, {"mhc_odds_ratio", "mhc_chisq", "mhc_p", "mhc_df"}, res.mhc,
        2);
}

}  // namespace

void printTableUsage(std::ostream& out) {
  out << "  qelcalc table FILE|- [--want chisq,lr,fisher,mcnemar,cramer,kappa,pearson,spearman,\n"
         "                gk,concordance,mhc,expected,residuals,standardized,adjusted,\n"
         "                contributions,colpct,rowpct,pct,coltotals,rowtotals,coltotalpct,\n"
         "                rowtotalpct,total|all]\n"
         "    A two-way table of counts, one row a line; writes each requested result\n"
         "    (default chisq) as \"name value\", cell results as \"name row value...\".\n"
         "    fisher, mcnemar and mhc need a 2 x 2 table (NaN otherwise).\n";
}

int runTableMode(int argc, char** argv, std::ostream& out) {
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (args.positional.size() != 1) throw UsageError("table takes one data file (or -)");
  for (const auto& option : args.options) {
    if (option.first != "want") throw UsageError("table has no option --" + option.first);
  }
  const unsigned mask = maskOf(args);
  Table table = readTable(args.positional[0]);
  int code = 0;
  qel::IContingencyTable* t = qel::MakeIContingencyTable(table.columns, table.rows, mask, &code);
  if (t == nullptr) throw UsageError("out of memory (message code " + std::to_string(code) + ")");
  Results res;
  lend(t, table, res, mask);
  code = t->Analyze();
  if ((mask & qel::kTableMHCTest) != 0) t->FinalizeMHCTest(res.mhc);
  qel::DeleteIContingencyTable(&t);
  if (code != 0) throw UsageError("the analysis failed with message code " + std::to_string(code));
  print(out, table, res, mask);
  return 0;
}

}  // namespace qelcalc
