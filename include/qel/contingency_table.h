/// \file
/// Analysis of one two-way table of counts. The host asks, by a bit mask given
/// at creation, for the results it wants, lends the object its counts and one
/// caller-owned buffer per wanted result, and calls Analyze, which fills them
/// all in one pass (independent statistics run in OpenMP sections).
///
/// The table is held by column: cell (c, r) is entry r of column c, and each
/// column is an array of `rows` doubles lent by SetupObservedCounts(column, c).
/// Counts need not be whole numbers. The object never owns the host's arrays.
///
/// Calling order: MakeIContingencyTable; SetupObservedCounts for every column
/// and one Setup call for each bit of the mask (the column-wise results once
/// for every column); Analyze. Analyze may run again on new counts. For a
/// stratified Mantel-Haenszel-Cochran analysis, lend the next stratum's columns
/// and call Analyze once per stratum (each adds to the same buffer), then call
/// FinalizeMHCTest once.
///
/// Marks in the results: NaN where a statistic does not exist (an empty
/// margin, N at most 1 for the correlations); -2.0 in the P-value slot of the
/// Fisher, McNemar and Mantel-Haenszel-Cochran results when the table is not
/// 2 x 2. Rows and columns with a total of 0 or less count as empty, and a
/// table whose grand total is not finite (a NaN or infinite count) as having
/// no non-empty row or column. Counts are not checked otherwise: a negative
/// count goes through the formulas, except that the exact tests give NaN.
/// A column never lent counts as a column of zeros. A Setup call for a
/// result outside the mask, or for a column index not below `columns`, is
/// ignored; a null buffer for a requested result is skipped.
///
/// Message codes: 0, or 30001 when memory runs out (a null object from
/// MakeIContingencyTable; from Analyze, with the results of that pass
/// incomplete). The code is kept: once set, Analyze keeps returning it.
#ifndef QEL_CONTINGENCY_TABLE_H
#define QEL_CONTINGENCY_TABLE_H

#include <qel/export.h>

namespace qel {

/// Bits of the request mask, and the size of each result buffer.
enum EContingencyResult : unsigned {
  kTableExpectedCounts = 0x1,              ///< columns of R values
  kTableRawResiduals = 0x2,                ///< columns, o - e
  kTableStandardizedResiduals = 0x4,       ///< columns, (o - e) / sqrt(e)
  kTableAdjustedResiduals = 0x8,           ///< columns
  kTableChisquareContributions = 0x10,     ///< columns, (o - e)^2 / e
  kTableColumnPercentages = 0x20,          ///< columns, of the column total
  kTableRowPercentages = 0x40,             ///< columns, of the row total
  kTablePercentages = 0x80,                ///< columns, of the grand total
  kTableColumnTotals = 0x100,              ///< C values
  kTableRowTotals = 0x200,                 ///< R values
  kTableColumnTotalPercentages = 0x400,    ///< C values
  kTableRowTotalPercentages = 0x800,       ///< R values
  kTableGrandTotal = 0x1000,               ///< 1 value
  kTablePearsonChisquare = 0x2000,         ///< statistic, df, P-value
  kTableLikelihoodRatio = 0x4000,          ///< statistic, df, P-value
  kTableFisherExact = 0x8000,              ///< two-sided P-value (2 x 2 only)
  kTableMcNemar = 0x10000,                 ///< estimate, lower, upper, P-value
  kTableCramerVSquare = 0x20000,           ///< 1 value
  kTableKappa = 0x40000,                   ///< 1 value
  kTablePearsonR = 0x80000,                ///< 1 value
  kTableSpearmanRho = 0x100000,            ///< 1 value
  kTableGoodmanKruskal = 0x200000,         ///< 4 values (see SetupGoodmanKruskal)
  kTableMeasuresOfConcordance = 0x400000,  ///< 9 values (see SetupMeasuresOfConcordance)
  kTableMHCTest = 0x800000,                ///< 4 values (see SetupMHCTest)
};

/// One two-way table and the buffers of its requested results; made by
/// MakeIContingencyTable, freed by DeleteIContingencyTable. The calling
/// order, the marks and the codes are in the file description.
class IContingencyTable {
 public:
  /// Frees the object (hosts call DeleteIContingencyTable).
  virtual ~IContingencyTable() {}

  /// Column c of the observed counts: `rows` values.
  virtual void SetupObservedCounts(double const* column, unsigned c) = 0;
  /// Fills every requested buffer; returns the message code.
  virtual int Analyze() = 0;
  /// Kept for the interface; no computation reads the proportions.
  virtual void SetupTestProportions(double const* proportions) = 0;

  /// \name Column-wise results
  /// Column-wise results: column c of the result, `rows` values.
  //@{
  /// Expected counts e = row total * column total / N.
  virtual void SetupExpectedCounts(double* column, unsigned c) = 0;
  /// Raw residuals o - e.
  virtual void SetupRawResiduals(double* column, unsigned c) = 0;
  /// Standardized residuals (o - e) / sqrt(e).
  virtual void SetupStandardizedResiduals(double* column, unsigned c) = 0;
  /// Haberman's adjusted residuals (o - e) / sqrt(e (1 - column total / N)
  /// (1 - row total / N)).
  virtual void SetupAdjustedResiduals(double* column, unsigned c) = 0;
  /// Contributions (o - e)^2 / e to the Pearson statistic.
  virtual void SetupChisquareContributions(double* column, unsigned c) = 0;
  /// Percentages of the column total.
  virtual void SetupColumnPercentages(double* column, unsigned c) = 0;
  /// Percentages of the row total.
  virtual void SetupRowPercentages(double* column, unsigned c) = 0;
  /// Percentages of the grand total.
  virtual void SetupPercentages(double* column, unsigned c) = 0;
  //@}

  virtual void SetupColumnTotals(double* result) = 0;            ///< C values
  virtual void SetupRowTotals(double* result) = 0;               ///< R values
  virtual void SetupColumnTotalPercentages(double* result) = 0;  ///< C values
  virtual void SetupRowTotalPercentages(double* result) = 0;     ///< R values
  virtual void SetupGrandTotal(double* result) = 0;              ///< 1 value
  /// Statistic, degrees of freedom (R' - 1)(C' - 1) over the non-empty rows
  /// and columns, upper-tail chi-square P-value.
  virtual void SetupPearsonChisquareTest(double* result) = 0;
  /// G = 2 sum o ln(o / e), degrees of freedom, P-value.
  virtual void SetupLikelihoodRatioTest(double* result) = 0;
  /// Two-sided P-value of Fisher's exact test.
  virtual void SetupFisherExactTest(double* result) = 0;
  /// With b = cell (1, 0) and c = cell (0, 1): estimate (b - c) / N, lower and
  /// upper bound at 95% with a continuity term, exact binomial P-value.
  virtual void SetupMcNemarTest(double* result) = 0;
  /// Cramer's V squared: chi-square / (N (min(R', C') - 1)).
  virtual void SetupCramerVSquare(double* result) = 0;
  /// levelMarks line up the levels of the two margins: walking with column
  /// and row index from 0, a mark of -1.0 skips a row level, 1.0 skips a
  /// column level, any other value matches the pair (a diagonal cell). All
  /// marks 0 with markCount = C = R give the usual Cohen kappa.
  virtual void SetupKappa(double const* levelMarks, double* result, unsigned markCount) = 0;
  /// Correlations on the table: index scores (Pearson), midranks (Spearman).
  virtual void SetupPearsonR(double* result) = 0;
  /// Spearman's rho on the midranks of the margins.
  virtual void SetupSpearmanRho(double* result) = 0;
  /// lambda of rows given columns, lambda of columns given rows, tau of rows
  /// given columns, tau of columns given rows.
  virtual void SetupGoodmanKruskal(double* result) = 0;
  /// Concordant, discordant, tied and all pairs; Somers d of rows, Somers d
  /// of columns, gamma, Kendall tau-b, upper-tail P-value of the z statistic.
  virtual void SetupMeasuresOfConcordance(double* result) = 0;
  /// Zeroes the buffer on the first stratum only, so that later strata add
  /// to it: sum of a - E, sum of the variances of a, sum of ad / N, sum of
  /// bc / N.
  virtual void SetupMHCTest(double* result) = 0;
  /// Turns the sums into common odds ratio, continuity-corrected chi-square,
  /// P-value and degrees of freedom (1.0); (NaN, NaN, -2.0, NaN) when the
  /// first stratum was not 2 x 2.
  virtual void FinalizeMHCTest(double* result) = 0;
};

/// A table of `columns` x `rows` for the results in mask. *msgCode gets 0, or
/// 30001 with a null result when memory runs out.
QEL_API IContingencyTable* MakeIContingencyTable(unsigned columns, unsigned rows, unsigned mask,
                                                 int* msgCode);
/// Frees *table if it is not null, and sets it to null.
QEL_API void DeleteIContingencyTable(IContingencyTable** table);

}  // namespace qel

#endif
