// Contingency tables (a two-way table of counts, rows x columns as printed),
// the Mantel-Haenszel-Cochran test over 2 x 2 strata and the chi-square
// goodness-of-fit test of category counts.
#include <qel/contingency_table.h>
#include <qel/tabular_gof.h>

#include <map>
#include <memory>
#include <sstream>

#include "common.h"

namespace qelpy {

namespace {

py::object f(double v) {
  return py::float_(v);
}

struct Request {
  const char* name;
  unsigned bit;
};
// The names qelcalc's `table --want` uses.
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
};

// "all", one name or a comma list (or a sequence of names) as a mask.
unsigned maskOf(py::handle want) {
  std::vector<std::string> names;
  if (py::isinstance<py::str>(want)) {
    std::stringstream s(want.cast<std::string>());
    std::string name;
    while (std::getline(s, name, ',')) names.push_back(name);
  } else {
    for (py::handle item : want) names.push_back(py::str(item));
  }
  unsigned mask = 0;
  for (const std::string& name : names) {
    if (name == "all") {
      for (const Request& r : kRequests) mask |= r.bit;
      continue;
    }
    bool known = false;
    for (const Request& r : kRequests) {
      if (name == r.name) mask |= r.bit, known = true;
    }
    if (!known) throw py::value_error("unknown table result '" + name + "'");
  }
  return mask;
}

// Counts of a rows x columns table, stored by column as the library holds
// them.
struct Counts {
  Counts(py::handle obj, const char* name) {
    Doubles t = numbers(obj, name);
    if (t.ndim() != 2 || t.shape(0) < 1 || t.shape(1) < 1) {
      throw py::value_error(std::string(name) + " must be a two-dimensional table of counts");
    }
    rows = static_cast<unsigned>(t.shape(0));
    columns = static_cast<unsigned>(t.shape(1));
    byColumn.resize(static_cast<std::size_t>(rows) * columns);
    for (unsigned r = 0; r < rows; ++r) {
      for (unsigned c = 0; c < columns; ++c) column(c)[r] = t.data()[r * columns + c];
    }
  }
  double* column(unsigned c) { return byColumn.data() + static_cast<std::size_t>(c) * rows; }
  unsigned rows = 0, columns = 0;
  std::vector<double> byColumn;
};

// A table object and the buffers it fills; released on every path.
struct Analysis {
  Analysis(unsigned columns, unsigned rows, unsigned mask) {
    int code = 0;
    table = qel::MakeIContingencyTable(columns, rows, mask, &code);
    check(code);
    if (table == nullptr) throw CodeError(qel::qelFailOutOfMemory);
  }
  ~Analysis() { qel::DeleteIContingencyTable(&table); }
  Analysis(const Analysis&) = delete;
  Analysis& operator=(const Analysis&) = delete;
  qel::IContingencyTable* table = nullptr;
};

using CellSetup = void (qel::IContingencyTable::*)(double*, unsigned);

// A cell result: one buffer per column, returned as rows x columns.
struct CellResult {
  const char* name;
  unsigned bit;
  CellSetup setup;
  std::vector<double> values;
};

py::array_t<double> asTable(const std::vector<double>& byColumn, unsigned rows, unsigned columns) {
  py::array_t<double> a({static_cast<py::ssize_t>(rows), static_cast<py::ssize_t>(columns)});
  for (unsigned r = 0; r < rows; ++r) {
    for (unsigned c = 0; c < columns; ++c) {
      a.mutable_data()[r * columns + c] = byColumn[static_cast<std::size_t>(c) * rows + r];
    }
  }
  return a;
}

py::object contingencyTable(py::handle counts, py::handle want, py::handle kappaMarks) {
  Counts t(counts, "counts");
  unsigned mask = maskOf(want);
  std::vector<double> marks;
  if (!kappaMarks.is_none()) {
    Doubles k = column(kappaMarks, "kappa_marks");
    marks.assign(k.data(), k.data() + k.size());
  } else if (t.rows == t.columns) {
    marks.assign(t.rows, 0.0);  // Cohen's kappa on the diagonal
  } else {
    mask &= ~static_cast<unsigned>(qel::kTableKappa);
  }
  const unsigned R = t.rows, C = t.columns;
  using T = qel::IContingencyTable;
  std::vector<CellResult> cells = {
      {"expected", qel::kTableExpectedCounts, &T::SetupExpectedCounts, {}},
      {"residuals", qel::kTableRawResiduals, &T::SetupRawResiduals, {}},
      {"standardized_residuals",
       qel::kTableStandardizedResiduals,
       &T::SetupStandardizedResiduals,
       {}},
      {"adjusted_residuals", qel::kTableAdjustedResiduals, &T::SetupAdjustedResiduals, {}},
      {"contributions", qel::kTableChisquareContributions, &T::SetupChisquareContributions, {}},
      {"column_percentages", qel::kTableColumnPercentages, &T::SetupColumnPercentages, {}},
      {"row_percentages", qel::kTableRowPercentages, &T::SetupRowPercentages, {}},
      {"percentages", qel::kTablePercentages, &T::SetupPercentages, {}}};
  std::vector<double> colTotals(C, kNaN), rowTotals(R, kNaN), colPct(C, kNaN), rowPct(R, kNaN);
  double total = kNaN, cramer = kNaN, kappa = kNaN, pearson = kNaN, spearman = kNaN;
  double chisq[3] = {kNaN, kNaN, kNaN}, lr[3] = {kNaN, kNaN, kNaN}, fisher = kNaN;
  double mcnemar[4] = {kNaN, kNaN, kNaN, kNaN}, gk[4] = {kNaN, kNaN, kNaN, kNaN};
  double concordance[9];
  std::fill(std::begin(concordance), std::end(concordance), kNaN);

  Analysis a(C, R, mask);
  T* table = a.table;
  for (unsigned c = 0; c < C; ++c) table->SetupObservedCounts(t.column(c), c);
  for (CellResult& cell : cells) {
    if (!(mask & cell.bit)) continue;
    cell.values.assign(static_cast<std::size_t>(R) * C, kNaN);
    for (unsigned c = 0; c < C; ++c) (table->*cell.setup)(cell.values.data() + c * R, c);
  }
  table->SetupColumnTotals(colTotals.data());
  table->SetupRowTotals(rowTotals.data());
  table->SetupColumnTotalPercentages(colPct.data());
  table->SetupRowTotalPercentages(rowPct.data());
  table->SetupGrandTotal(&total);
  table->SetupPearsonChisquareTest(chisq);
  table->SetupLikelihoodRatioTest(lr);
  table->SetupFisherExactTest(&fisher);
  table->SetupMcNemarTest(mcnemar);
  table->SetupCramerVSquare(&cramer);
  if (mask & qel::kTableKappa) {
    table->SetupKappa(marks.data(), &kappa, static_cast<unsigned>(marks.size()));
  }
  table->SetupPearsonR(&pearson);
  table->SetupSpearmanRho(&spearman);
  table->SetupGoodmanKruskal(gk);
  table->SetupMeasuresOfConcordance(concordance);
  const int code = released([&] { return table->Analyze(); });
  check(code);

  Fields fields = {{"rows", py::int_(R)}, {"columns", py::int_(C)}};
  for (const CellResult& cell : cells) {
    if (mask & cell.bit) fields.push_back({cell.name, asTable(cell.values, R, C)});
  }
  auto add = [&](unsigned bit, Fields more) {
    if (mask & bit) fields.insert(fields.end(), more.begin(), more.end());
  };
  add(qel::kTableColumnTotals, {{"column_totals", toArray(colTotals.data(), C)}});
  add(qel::kTableRowTotals, {{"row_totals", toArray(rowTotals.data(), R)}});
  add(qel::kTableColumnTotalPercentages, {{"column_total_percentages", toArray(colPct.data(), C)}});
  add(qel::kTableRowTotalPercentages, {{"row_total_percentages", toArray(rowPct.data(), R)}});
  add(qel::kTableGrandTotal, {{"total", f(total)}});
  add(qel::kTablePearsonChisquare,
      {{"chisq", f(chisq[0])}, {"chisq_df", f(chisq[1])}, {"chisq_p_value", f(chisq[2])}});
  add(qel::kTableLikelihoodRatio,
      {{"lr", f(lr[0])}, {"lr_df", f(lr[1])}, {"lr_p_value", f(lr[2])}});
  // -2 marks a 2 x 2 test on a table of another shape: NaN in Python.
  auto twoByTwo = [](double p) { return p == -2.0 ? kNaN : p; };
  add(qel::kTableFisherExact, {{"fisher_p_value", f(twoByTwo(fisher))}});
  add(qel::kTableMcNemar, {{"mcnemar_estimate", f(mcnemar[0])},
                           {"mcnemar_lower_limit", f(mcnemar[1])},
                           {"mcnemar_upper_limit", f(mcnemar[2])},
                           {"mcnemar_p_value", f(twoByTwo(mcnemar[3]))}});
  add(qel::kTableCramerVSquare, {{"cramer_v_square", f(cramer)}});
  add(qel::kTableKappa, {{"kappa", f(kappa)}});
  add(qel::kTablePearsonR, {{"pearson_r", f(pearson)}});
  add(qel::kTableSpearmanRho, {{"spearman_rho", f(spearman)}});
  add(qel::kTableGoodmanKruskal, {{"lambda_rows", f(gk[0])},
                                  {"lambda_columns", f(gk[1])},
                                  {"tau_rows", f(gk[2])},
                                  {"tau_columns", f(gk[3])}});
  add(qel::kTableMeasuresOfConcordance, {{"concordant", f(concordance[0])},
                                         {"discordant", f(concordance[1])},
                                         {"tied", f(concordance[2])},
                                         {"pairs", f(concordance[3])},
                                         {"somers_d_rows", f(concordance[4])},
                                         {"somers_d_columns", f(concordance[5])},
                                         {"gamma", f(concordance[6])},
                                         {"tau_b", f(concordance[7])},
                                         {"tau_b_p_value", f(concordance[8])}});
  return result("ContingencyTable", fields);
}

// The Mantel-Haenszel-Cochran test over strata of 2 x 2 tables.
py::object mantelHaenszel(py::handle strata) {
  Doubles s = numbers(strata, "strata");
  if (s.ndim() != 3 || s.shape(1) != 2 || s.shape(2) != 2 || s.shape(0) < 1) {
    throw py::value_error("strata must have the shape (k, 2, 2)");
  }
  Analysis a(2, 2, qel::kTableMHCTest);
  // The sums of the strata, turned in place into the results.
  double out[4] = {kNaN, kNaN, kNaN, kNaN};
  std::vector<double> columns(4);
  const int code = released([&] {
    int c = 0;
    for (py::ssize_t k = 0; k < s.shape(0) && c == 0; ++k) {
      const double* t = s.data() + k * 4;
      columns = {t[0], t[2], t[1], t[3]};  // by column
      a.table->SetupObservedCounts(columns.data(), 0);
      a.table->SetupObservedCounts(columns.data() + 2, 1);
      a.table->SetupMHCTest(out);
      c = a.table->Analyze();
    }
    if (c == 0) a.table->FinalizeMHCTest(out);
    return c;
  });
  check(code);
  return result("MantelHaenszel", {{"odds_ratio", f(out[0])},
                                   {"statistic", f(out[1])},
                                   {"p_value", f(out[2])},
                                   {"degrees_of_freedom", f(out[3])}});
}

py::object chisqGof(py::handle observed, py::handle proportions, py::handle total) {
  Doubles o = column(observed, "observed");
  Doubles p;
  if (!proportions.is_none()) {
    p = column(proportions, "proportions");
    if (p.size() != o.size()) {
      throw py::value_error("observed and proportions must have the same length");
    }
  }
  const unsigned k = count(o);
  double n = 0.0;
  if (total.is_none()) {
    for (unsigned i = 0; i < k; ++i) n += o.data()[i];
  } else {
    n = total.cast<double>();
  }
  std::vector<double> expected(k), contributions(k);
  double statistic = kNaN, pValue = kNaN, df = kNaN;
  const double* pp = proportions.is_none() ? nullptr : p.data();
  released([&] {
    return qel::RunLynTabularChiSqGOFTest(o.data(), pp, expected.data(), contributions.data(),
                                          &statistic, &pValue, &df, n, k);
  });
  return result("ChiSquareGoodnessOfFit", {{"expected", toArray(expected.data(), k)},
                                           {"contributions", toArray(contributions.data(), k)},
                                           {"statistic", f(statistic)},
                                           {"degrees_of_freedom", f(df)},
                                           {"p_value", f(pValue)}});
}

}  // namespace

void registerTables(py::module_& m) {
  m.def("contingency_table", &contingencyTable, py::arg("counts"), py::arg("want") = "all",
        py::arg("kappa_marks") = py::none(),
        "Analysis of a two-way table of counts (rows x columns). want: 'all' or names of "
        "qelcalc's table --want (expected, residuals, standardized, adjusted, contributions, "
        "colpct, rowpct, pct, coltotals, rowtotals, coltotalpct, rowtotalpct, total, chisq, lr, "
        "fisher, mcnemar, cramer, kappa, pearson, spearman, gk, concordance). 2 x 2 tests are "
        "NaN on other shapes; kappa needs a square table or kappa_marks.");
  m.def("mantel_haenszel", &mantelHaenszel, py::arg("strata"),
        "Mantel-Haenszel-Cochran test over 2 x 2 strata (an array of shape (k, 2, 2)).");
  m.def("chisq_gof", &chisqGof, py::arg("observed"), py::arg("proportions") = py::none(),
        py::arg("total") = py::none(),
        "Chi-square goodness of fit of category counts against proportions (equal by "
        "default); total defaults to the sum of the counts.");
}

}  // namespace qelpy
