// A host of IContingencyTable for the tests: lends a table given column by
// column and one buffer per result, every buffer filled with a sentinel
// first, so that a test can tell which buffers Analyze wrote.
#ifndef QEL_TESTS_CONTINGENCY_RUN_H
#define QEL_TESTS_CONTINGENCY_RUN_H

#include <qel/contingency_table.h>

#include <cstring>
#include <vector>

namespace qeltest {

constexpr double kSentinel = -7.77e77;
constexpr unsigned kAllTableResults = 0xFFFFFF;

struct TableHost {
  unsigned C = 0, R = 0;
  std::vector<double> counts;  // column by column
  // The eight column-wise results, each C * R values column by column, in
  // the order of the mask bits 0x1 to 0x80.
  std::vector<double> cells[8];
  std::vector<double> columnTotals, rowTotals, columnTotalPercentages, rowTotalPercentages;
  double grandTotal[1], pearson[3], likelihoodRatio[3], fisher[1], mcNemar[4], cramer[1], kappa[1],
      pearsonR[1], spearman[1], goodmanKruskal[4], concordance[9], mhc[4];
  std::vector<double> marks;
  int code = -1;

  TableHost(unsigned columns, unsigned rows, std::vector<double> table)
      : C(columns), R(rows), counts(std::move(table)), marks(columns < rows ? columns : rows, 0.0) {
    for (auto& v : cells) v.assign(static_cast<std::size_t>(C) * R, kSentinel);
    columnTotals.assign(C, kSentinel);
    columnTotalPercentages.assign(C, kSentinel);
    rowTotals.assign(R, kSentinel);
    rowTotalPercentages.assign(R, kSentinel);
    for (double* scalars : {grandTotal, pearson, likelihoodRatio, fisher, mcNemar, cramer, kappa,
                            pearsonR, spearman, goodmanKruskal, concordance, mhc}) {
      scalars[0] = kSentinel;
    }
    for (double* b : {pearson, likelihoodRatio}) b[1] = b[2] = kSentinel;
    for (double* b : {mcNemar, goodmanKruskal, mhc}) b[1] = b[2] = b[3] = kSentinel;
    for (int i = 1; i < 9; ++i) concordance[i] = kSentinel;
  }

  double cell(int result, unsigned c, unsigned r) const { return cells[result][c * R + r]; }

  // Lends the counts and the buffers of the results in mask (all of them,
  // when lendAll is true, except the MHC buffer, which Setup zeroes).
  void lend(qel::IContingencyTable* t, unsigned mask, bool lendAll = false) {
    for (unsigned c = 0; c < C; ++c) t->SetupObservedCounts(counts.data() + c * R, c);
    auto want = [&](unsigned bit) { return lendAll || (mask & bit) != 0; };
    using Setup = void (qel::IContingencyTable::*)(double*, unsigned);
    const Setup columnWise[8] = {&qel::IContingencyTable::SetupExpectedCounts,
                                 &qel::IContingencyTable::SetupRawResiduals,
                                 &qel::IContingencyTable::SetupStandardizedResiduals,
                                 &qel::IContingencyTable::SetupAdjustedResiduals,
                                 &qel::IContingencyTable::SetupChisquareContributions,
                                 &qel::IContingencyTable::SetupColumnPercentages,
                                 &qel::IContingencyTable::SetupRowPercentages,
                                 &qel::IContingencyTable::SetupPercentages};
    for (int k = 0; k < 8; ++k) {
      if (!want(1u << k)) continue;
      for (unsigned c = 0; c < C; ++c) (t->*columnWise[k])(cells[k].data() + c * R, c);
    }
    if (want(0x100)) t->SetupColumnTotals(columnTotals.data());
    if (want(0x200)) t->SetupRowTotals(rowTotals.data());
    if (want(0x400)) t->SetupColumnTotalPercentages(columnTotalPercentages.data());
    if (want(0x800)) t->SetupRowTotalPercentages(rowTotalPercentages.data());
    if (want(0x1000)) t->SetupGrandTotal(grandTotal);
    if (want(0x2000)) t->SetupPearsonChisquareTest(pearson);
    if (want(0x4000)) t->SetupLikelihoodRatioTest(likelihoodRatio);
    if (want(0x8000)) t->SetupFisherExactTest(fisher);
    if (want(0x10000)) t->SetupMcNemarTest(mcNemar);
    if (want(0x20000)) t->SetupCramerVSquare(cramer);
    if (want(0x40000)) t->SetupKappa(marks.data(), kappa, static_cast<unsigned>(marks.size()));
    if (want(0x80000)) t->SetupPearsonR(pearsonR);
    if (want(0x100000)) t->SetupSpearmanRho(spearman);
    if (want(0x200000)) t->SetupGoodmanKruskal(goodmanKruskal);
    if (want(0x400000)) t->SetupMeasuresOfConcordance(concordance);
    if ((mask & 0x800000) != 0) t->SetupMHCTest(mhc);
  }

  // Make, lend, Analyze once, FinalizeMHCTest when asked for, Delete.
  void run(unsigned mask = kAllTableResults, bool lendAll = false) {
    int made = -1;
    qel::IContingencyTable* t = qel::MakeIContingencyTable(C, R, mask, &made);
    if (t == nullptr) {
      code = made;
      return;
    }
    lend(t, mask, lendAll);
    code = t->Analyze();
    if ((mask & 0x800000) != 0) t->FinalizeMHCTest(mhc);
    qel::DeleteIContingencyTable(&t);
  }

  // Every buffer, flattened, for comparisons of whole runs.
  std::vector<double> everything() const {
    std::vector<double> all;
    for (auto const& v : cells) all.insert(all.end(), v.begin(), v.end());
    for (auto const* v : {&columnTotals, &rowTotals, &columnTotalPercentages, &rowTotalPercentages})
      all.insert(all.end(), v->begin(), v->end());
    all.insert(all.end(), grandTotal, grandTotal + 1);
    all.insert(all.end(), pearson, pearson + 3);
    all.insert(all.end(), likelihoodRatio, likelihoodRatio + 3);
    all.insert(all.end(), fisher, fisher + 1);
    all.insert(all.end(), mcNemar, mcNemar + 4);
    all.insert(all.end(), cramer, cramer + 1);
    all.insert(all.end(), kappa, kappa + 1);
    all.insert(all.end(), pearsonR, pearsonR + 1);
    all.insert(all.end(), spearman, spearman + 1);
    all.insert(all.end(), goodmanKruskal, goodmanKruskal + 4);
    all.insert(all.end(), concordance, concordance + 9);
    all.insert(all.end(), mhc, mhc + 4);
    return all;
  }
};

// Bitwise equality of two runs, NaN payloads included.
inline bool sameBits(std::vector<double> const& a, std::vector<double> const& b) {
  return a.size() == b.size() && std::memcmp(a.data(), b.data(), a.size() * sizeof(double)) == 0;
}

}  // namespace qeltest

#endif
