// The implementation of IContingencyTable, and the free functions that turn a
// table of counts into its results. Each function takes the table as an
// array of column pointers (o[c][r]), the margins, its own output buffer and
// the request mask; it returns at once when its bit is clear, reads only its
// inputs and writes only its own buffer, so that Analyze can run the
// functions of one stage in parallel sections. A null output is skipped.
#ifndef QEL_SRC_BASIC_STATISTICS_CONTINGENCYTABLE_H
#define QEL_SRC_BASIC_STATISTICS_CONTINGENCYTABLE_H

#include <qel/contingency_table.h>

namespace qel {

using TableColumns = double const* const*;
using TableOutput = double* const*;

// The test each function begins with: its bit is set and it has a buffer.
inline bool isRequested(unsigned mask, unsigned bit, void const* out) {
  return (mask & bit) != 0 && out != nullptr;
}

// Cell results (no guard: a zero total or a NaN expected count goes through
// as IEEE arithmetic gives it).
void GetColumnPercentages(TableColumns o, TableOutput out, double const* T, unsigned C, unsigned R,
                          unsigned mask);
void GetRowPercentages(TableColumns o, TableOutput out, double const* U, unsigned C, unsigned R,
                       unsigned mask);
void GetPercentages(TableColumns o, TableOutput out, double N, unsigned C, unsigned R,
                    unsigned mask);
void GetColumnTotalPercentages(double const* T, double* out, double N, unsigned C, unsigned mask);
void GetRowTotalPercentages(double const* U, double* out, double N, unsigned R, unsigned mask);
void GetRawResiduals(TableColumns o, TableColumns e, TableOutput out, unsigned C, unsigned R,
                     unsigned mask);
void GetStandardizedResiduals(TableColumns o, TableColumns e, TableOutput out, unsigned C,
                              unsigned R, unsigned mask);
void GetAdjustedResiduals(TableColumns o, TableColumns e, TableOutput out, double const* T,
                          double const* U, double N, unsigned C, unsigned R, unsigned mask);
void GetChisquareContributions(TableColumns o, TableColumns e, TableOutput out, unsigned C,
                               unsigned R, unsigned mask);

// Chi-square family. Cp and Rp count the columns and rows with a total
// above 0.
void GetPearsonChisquareTest(TableColumns o, TableColumns e, double* out, double const* T,
                             unsigned C, unsigned R, unsigned Cp, unsigned Rp, unsigned mask);
// Leaves -1.0 in the P-value slot; Analyze replaces it on the calling thread.
void GetLikelihoodRatioTest(TableColumns o, TableColumns e, double* out, double const* T,
                            unsigned C, unsigned R, unsigned Cp, unsigned Rp, unsigned mask);
void GetCramerVSquared(TableColumns o, TableColumns e, double const* T, double* out, double N,
                       unsigned C, unsigned R, unsigned Cp, unsigned Rp, unsigned mask);
void GetFisherExactTest(TableColumns o, double const* T, double const* U, double* out, double N,
                        unsigned C, unsigned R, unsigned Cp, unsigned Rp, unsigned mask);
void GetMcNemarTest(TableColumns o, double const* T, double const* U, double* out, double N,
                    unsigned C, unsigned R, unsigned Cp, unsigned Rp, unsigned mask);
// Adds one stratum to the sums in out; clears *firstStratum.
void GetMHCTest(TableColumns o, double const* T, double const* U, double* out, bool* firstStratum,
                bool* invalidStratum, double N, unsigned C, unsigned R, unsigned Cp, unsigned Rp,
                unsigned mask);
void FinalizeMHCSums(double* out, bool invalidStratum);

// Association measures.
void GetCohenKappa(TableColumns o, double const* T, double const* U, double const* marks,
                   double* out, double N, unsigned C, unsigned R, unsigned markCount,
                   unsigned mask);
void GetPearsonR(TableColumns o, double* out, double N, unsigned C, unsigned R, unsigned mask);
void GetSpearmanRho(TableColumns o, double const* T, double const* U, double* out, double N,
                    unsigned C, unsigned R, unsigned mask);
void GetGoodmanKruskalPRE(TableColumns o, double const* T, double const* U, double* out, double N,
                          unsigned C, unsigned R, unsigned mask);
// Slot 8 holds the z statistic; Analyze turns it into its P-value.
void GetConcordanceMeasures(TableColumns o, double const* T, double const* U, double* out, double N,
                            unsigned C, unsigned R, unsigned mask);

class ContingencyTable : public IContingencyTable {
 public:
  ContingencyTable(unsigned columns, unsigned rows, unsigned mask);
  ContingencyTable(const ContingencyTable&) = delete;
  ContingencyTable& operator=(const ContingencyTable&) = delete;
  ~ContingencyTable() override;

  void SetupObservedCounts(double const* column, unsigned c) override;
  int Analyze() override;
  void SetupTestProportions(double const* proportions) override;
  void SetupExpectedCounts(double* column, unsigned c) override;
  void SetupRawResiduals(double* column, unsigned c) override;
  void SetupStandardizedResiduals(double* column, unsigned c) override;
  void SetupAdjustedResiduals(double* column, unsigned c) override;
  void SetupChisquareContributions(double* column, unsigned c) override;
  void SetupColumnPercentages(double* column, unsigned c) override;
  void SetupRowPercentages(double* column, unsigned c) override;
  void SetupPercentages(double* column, unsigned c) override;
  void SetupColumnTotals(double* result) override;
  void SetupRowTotals(double* result) override;
  void SetupColumnTotalPercentages(double* result) override;
  void SetupRowTotalPercentages(double* result) override;
  void SetupGrandTotal(double* result) override;
  void SetupPearsonChisquareTest(double* result) override;
  void SetupLikelihoodRatioTest(double* result) override;
  void SetupFisherExactTest(double* result) override;
  void SetupMcNemarTest(double* result) override;
  void SetupCramerVSquare(double* result) override;
  void SetupKappa(double const* levelMarks, double* result, unsigned markCount) override;
  void SetupPearsonR(double* result) override;
  void SetupSpearmanRho(double* result) override;
  void SetupGoodmanKruskal(double* result) override;
  void SetupMeasuresOfConcordance(double* result) override;
  void SetupMHCTest(double* result) override;
  void FinalizeMHCTest(double* result) override;

  int GetMsgCode() const { return mMsgCode; }

 private:
  void PrepareForAdditionalStatistics();
  // Stores p at index c of a pointer array, if the array exists and c is
  // inside the table.
  void storeColumn(double** columns, double* p, unsigned c) const;
  int analyzeTable();

  double const** mObserved = nullptr;
  double const* mTestProportions = nullptr;
  double** mExpected = nullptr;
  double** mRawResiduals = nullptr;
  double** mStandardized = nullptr;
  double** mAdjusted = nullptr;
  double** mContributions = nullptr;
  double** mColumnPercentages = nullptr;
  double** mRowPercentages = nullptr;
  double** mPercentages = nullptr;
  double* mColumnTotals = nullptr;
  double* mRowTotals = nullptr;
  double* mColumnTotalPercentages = nullptr;
  double* mRowTotalPercentages = nullptr;
  double* mGrandTotal = nullptr;
  double* mPearson = nullptr;
  double* mLikelihoodRatio = nullptr;
  double* mFisher = nullptr;
  double* mMcNemar = nullptr;
  double* mCramer = nullptr;
  double* mKappa = nullptr;
  double const* mKappaMarks = nullptr;
  double* mPearsonR = nullptr;
  double* mSpearman = nullptr;
  double* mGoodmanKruskal = nullptr;
  double* mConcordance = nullptr;
  double* mMHC = nullptr;
  unsigned mColumns;
  unsigned mRows;
  unsigned mMask;
  unsigned mKappaMarkCount = 0;
  int mMsgCode = 0;
  bool mFirstStratum = true;
  bool mInvalidStratum = false;
};

}  // namespace qel

#endif
