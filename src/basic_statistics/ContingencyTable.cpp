// The contingency table object: its lifecycle, the Setup operations that
// only store what they are given, and Analyze, which computes the margins,
// then every requested result in three parallel regions of sections.
#include "basic_statistics/ContingencyTable.h"

#include <omp.h>
#include <qel/basic_types.h>
#include <qel/distributions.h>

#include <cmath>
#include <new>
#include <vector>

#include "interfaces/math/random_distributions_v1.h"

namespace qel {

namespace {

// Results whose computation reads the expected counts.
constexpr unsigned kUsesExpected = 0x2601F;

// Runs body(0), ..., body(count - 1) as concurrent sections: a parallel loop
// of static schedule with a chunk of one. A section that runs out of memory
// is counted, not propagated, so that no exception leaves the region.
template <class Body>
int runSections(int count, Body body) {
  int failures = 0;
#pragma omp parallel for schedule(static, 1) reduction(+ : failures)
  for (int section = 0; section < count; ++section) {
    try {
      body(section);
    } catch (std::bad_alloc const&) {
      ++failures;
    }
  }
  return failures;
}

// Column totals, their sum N and the count of columns with a total above 0.
void sumColumns(TableColumns o, double* T, unsigned C, unsigned R, double* N, unsigned* Cp) {
  double grand = 0.0;
  unsigned positive = 0;
  for (unsigned c = 0; c < C; ++c) {
    double total = 0.0;
    for (unsigned r = 0; r < R; ++r) total += o[c][r];
    T[c] = total;
    grand += total;
    if (total > 0.0) ++positive;
  }
  *N = grand;
  *Cp = positive;
}

// Row totals, summed column by column so that each column is read in order.
void sumRows(TableColumns o, double* U, unsigned C, unsigned R, unsigned* Rp) {
  for (unsigned r = 0; r < R; ++r) U[r] = 0.0;
  for (unsigned c = 0; c < C; ++c) {
    for (unsigned r = 0; r < R; ++r) U[r] += o[c][r];
  }
  unsigned positive = 0;
  for (unsigned r = 0; r < R; ++r) {
    if (U[r] > 0.0) ++positive;
  }
  *Rp = positive;
}

// Expected counts under independence, NaN in an empty row or column.
void fillExpected(double* const* e, double const* T, double const* U, double N, unsigned C,
                  unsigned R) {
  for (unsigned c = 0; c < C; ++c) {
    if (!(T[c] > 0.0)) {
      for (unsigned r = 0; r < R; ++r) e[c][r] = std::nan("");
      continue;
    }
    const double f = T[c] / N;
    for (unsigned r = 0; r < R; ++r) e[c][r] = U[r] > 0.0 ? U[r] * f : std::nan("");
  }
}

// A pointer array of n entries, all null.
template <class T>
T** newPointerArray(unsigned n) {
  return new T*[n]();
}

}  // namespace

ContingencyTable::ContingencyTable(unsigned columns, unsigned rows, unsigned mask)
    : mColumns(columns), mRows(rows), mMask(mask) {
  try {
    mObserved = newPointerArray<double const>(columns);
  } catch (std::bad_alloc const&) {
    mMsgCode = qelFailOutOfMemory;
  }
  if (mMask != 0) PrepareForAdditionalStatistics();
}

// The pointer arrays that the mask calls for. Expected counts enter every
// result of kUsesExpected (Cramer's V among them), so their array exists
// whenever one of those is asked for.
void ContingencyTable::PrepareForAdditionalStatistics() {
  struct Need {
    unsigned bits;
    double*** array;
  };
  const Need needs[] = {{kUsesExpected, &mExpected},
                        {kTableRawResiduals, &mRawResiduals},
                        {kTableStandardizedResiduals, &mStandardized},
                        {kTableAdjustedResiduals, &mAdjusted},
                        {kTableChisquareContributions, &mContributions},
                        {kTableColumnPercentages, &mColumnPercentages},
                        {kTableRowPercentages, &mRowPercentages},
                        {kTablePercentages, &mPercentages}};
  try {
    for (Need const& need : needs) {
      if ((mMask & need.bits) != 0) *need.array = newPointerArray<double>(mColumns);
    }
  } catch (std::bad_alloc const&) {
    mMsgCode = qelFailOutOfMemory;
  }
}

ContingencyTable::~ContingencyTable() {
  delete[] mObserved;
  delete[] mExpected;
  delete[] mRawResiduals;
  delete[] mStandardized;
  delete[] mAdjusted;
  delete[] mContributions;
  delete[] mColumnPercentages;
  delete[] mRowPercentages;
  delete[] mPercentages;
}

void ContingencyTable::storeColumn(double** columns, double* p, unsigned c) const {
  if (columns != nullptr && c < mColumns) columns[c] = p;
}

void ContingencyTable::SetupObservedCounts(double const* column, unsigned c) {
  if (mObserved != nullptr && c < mColumns) mObserved[c] = column;
}
void ContingencyTable::SetupTestProportions(double const* proportions) {
  mTestProportions = proportions;
}
void ContingencyTable::SetupExpectedCounts(double* column, unsigned c) {
  storeColumn(mExpected, column, c);
}
void ContingencyTable::SetupRawResiduals(double* column, unsigned c) {
  storeColumn(mRawResiduals, column, c);
}
void ContingencyTable::SetupStandardizedResiduals(double* column, unsigned c) {
  storeColumn(mStandardized, column, c);
}
void ContingencyTable::SetupAdjustedResiduals(double* column, unsigned c) {
  storeColumn(mAdjusted, column, c);
}
void ContingencyTable::SetupChisquareContributions(double* column, unsigned c) {
  storeColumn(mContributions, column, c);
}
void ContingencyTable::SetupColumnPercentages(double* column, unsigned c) {
  storeColumn(mColumnPercentages, column, c);
}
void ContingencyTable::SetupRowPercentages(double* column, unsigned c) {
  storeColumn(mRowPercentages, column, c);
}
void ContingencyTable::SetupPercentages(double* column, unsigned c) {
  storeColumn(mPercentages, column, c);
}
void ContingencyTable::SetupColumnTotals(double* result) {
  mColumnTotals = result;
}
void ContingencyTable::SetupRowTotals(double* result) {
  mRowTotals = result;
}
void ContingencyTable::SetupColumnTotalPercentages(double* result) {
  mColumnTotalPercentages = result;
}
void ContingencyTable::SetupRowTotalPercentages(double* result) {
  mRowTotalPercentages = result;
}
void ContingencyTable::SetupGrandTotal(double* result) {
  mGrandTotal = result;
}
void ContingencyTable::SetupPearsonChisquareTest(double* result) {
  mPearson = result;
}
void ContingencyTable::SetupLikelihoodRatioTest(double* result) {
  mLikelihoodRatio = result;
}
void ContingencyTable::SetupFisherExactTest(double* result) {
  mFisher = result;
}
void ContingencyTable::SetupMcNemarTest(double* result) {
  mMcNemar = result;
}
void ContingencyTable::SetupCramerVSquare(double* result) {
  mCramer = result;
}
void ContingencyTable::SetupKappa(double const* levelMarks, double* result, unsigned markCount) {
  mKappaMarks = levelMarks;
  mKappa = result;
  mKappaMarkCount = markCount;
}
void ContingencyTable::SetupPearsonR(double* result) {
  mPearsonR = result;
}
void ContingencyTable::SetupSpearmanRho(double* result) {
  mSpearman = result;
}
void ContingencyTable::SetupGoodmanKruskal(double* result) {
  mGoodmanKruskal = result;
}
void ContingencyTable::SetupMeasuresOfConcordance(double* result) {
  mConcordance = result;
}

// The buffer of the stratified test is zeroed once, for the first stratum;
// later calls leave it alone so that the strata add up in it.
void ContingencyTable::SetupMHCTest(double* result) {
  if (!mFirstStratum) return;
  if (result != nullptr) {
    for (int i = 0; i < 4; ++i) result[i] = 0.0;
  }
  mMHC = result;
}

void ContingencyTable::FinalizeMHCTest(double* result) {
  if (result != nullptr) FinalizeMHCSums(result, mInvalidStratum);
}

int ContingencyTable::Analyze() {
  if (mMask == 0) return mMsgCode;
  try {
    if (analyzeTable() != 0) mMsgCode = qelFailOutOfMemory;
  } catch (std::bad_alloc const&) {
    // The temporaries are vectors: what was made so far is already freed.
    mMsgCode = qelFailOutOfMemory;
  }
  return mMsgCode;
}

// One pass over the table; answers the number of sections that ran out of
// memory. A std::bad_alloc outside the regions propagates to Analyze.
int ContingencyTable::analyzeTable() {
  if (mObserved == nullptr) return 1;
  const unsigned C = mColumns, R = mRows, mask = mMask;

  // A column never lent reads as a column of zeros.
  std::vector<double const*> o(mObserved, mObserved + C);
  std::vector<double> zeros;
  for (double const*& column : o) {
    if (column != nullptr) continue;
    if (zeros.empty()) zeros.assign(R + 1, 0.0);
    column = zeros.data();
  }

  std::vector<double> ownColumnTotals, ownRowTotals;
  double* T = mColumnTotals;
  double* U = mRowTotals;
  if ((mask & kTableColumnTotals) == 0 || T == nullptr) {
    ownColumnTotals.resize(C + 1);
    T = ownColumnTotals.data();
  }
  if ((mask & kTableRowTotals) == 0 || U == nullptr) {
    ownRowTotals.resize(R + 1);
    U = ownRowTotals.data();
  }

  double N = 0.0;
  unsigned Cp = 0, Rp = 0;
  int failures = runSections(2, [&](int section) {
    if (section == 0) sumColumns(o.data(), T, C, R, &N, &Cp);
    if (section == 1) sumRows(o.data(), U, C, R, &Rp);
  });
  // A count that is NaN or infinite leaves no margin to test against: the
  // table then counts as having no non-empty row or column.
  if (!std::isfinite(N)) Cp = Rp = 0;

  failures += runSections(5, [&](int section) {
    if (section == 0) GetColumnPercentages(o.data(), mColumnPercentages, T, C, R, mask);
    if (section == 1) GetColumnTotalPercentages(T, mColumnTotalPercentages, N, C, mask);
    if (section == 2) GetRowPercentages(o.data(), mRowPercentages, U, C, R, mask);
    if (section == 3) GetRowTotalPercentages(U, mRowTotalPercentages, N, R, mask);
    if (section == 4) GetPercentages(o.data(), mPercentages, N, C, R, mask);
  });

  // Expected counts: the host's columns where it asked for them and lent
  // them, temporary ones elsewhere.
  std::vector<double*> e(C + 1, nullptr);
  std::vector<double> ownExpected;
  if ((mask & kUsesExpected) != 0) {
    const bool hostColumns = (mask & kTableExpectedCounts) != 0 && mExpected != nullptr;
    unsigned missing = 0;
    for (unsigned c = 0; c < C; ++c) {
      if (!hostColumns || mExpected[c] == nullptr) ++missing;
    }
    ownExpected.resize(static_cast<std::size_t>(missing) * R + 1);
    std::size_t next = 0;
    for (unsigned c = 0; c < C; ++c) {
      if (hostColumns && mExpected[c] != nullptr) {
        e[c] = mExpected[c];
      } else {
        e[c] = ownExpected.data() + next;
        next += R;
      }
    }
    fillExpected(e.data(), T, U, N, C, R);
  }
  TableColumns ex = e.data();

  failures += runSections(13, [&](int section) {
    switch (section) {
      case 0:
        GetRawResiduals(o.data(), ex, mRawResiduals, C, R, mask);
        break;
      case 1:
        GetStandardizedResiduals(o.data(), ex, mStandardized, C, R, mask);
        break;
      case 2:
        GetAdjustedResiduals(o.data(), ex, mAdjusted, T, U, N, C, R, mask);
        break;
      case 3:
        GetChisquareContributions(o.data(), ex, mContributions, C, R, mask);
        break;
      case 4:
        GetPearsonChisquareTest(o.data(), ex, mPearson, T, C, R, Cp, Rp, mask);
        break;
      case 5:
        GetLikelihoodRatioTest(o.data(), ex, mLikelihoodRatio, T, C, R, Cp, Rp, mask);
        break;
      case 6:
        GetCramerVSquared(o.data(), ex, T, mCramer, N, C, R, Cp, Rp, mask);
        break;
      case 7:
        GetCohenKappa(o.data(), T, U, mKappaMarks, mKappa, N, C, R, mKappaMarkCount, mask);
        break;
      case 8:
        GetPearsonR(o.data(), mPearsonR, N, C, R, mask);
        break;
      case 9:
        GetSpearmanRho(o.data(), T, U, mSpearman, N, C, R, mask);
        break;
      case 10:
        GetGoodmanKruskalPRE(o.data(), T, U, mGoodmanKruskal, N, C, R, mask);
        break;
      case 11:
        GetConcordanceMeasures(o.data(), T, U, mConcordance, N, C, R, mask);
        break;
      case 12:
        GetMHCTest(o.data(), T, U, mMHC, &mFirstStratum, &mInvalidStratum, N, C, R, Cp, Rp, mask);
        break;
      default:
        break;
    }
  });

  // The P-values that the sections leave to the calling thread.
  if ((mask & kTableLikelihoodRatio) != 0 && mLikelihoodRatio != nullptr &&
      mLikelihoodRatio[2] == -1.0) {
    mLikelihoodRatio[2] = ChiSqCdf(mLikelihoodRatio[0], mLikelihoodRatio[1], 0.0, true);
  }
  GetFisherExactTest(o.data(), T, U, mFisher, N, C, R, Cp, Rp, mask);
  GetMcNemarTest(o.data(), T, U, mMcNemar, N, C, R, Cp, Rp, mask);
  if ((mask & kTableMeasuresOfConcordance) != 0 && mConcordance != nullptr) {
    mConcordance[8] = v1::NormalPValue(mConcordance[8], kAlternativeGreater);
  }
  if ((mask & kTableGrandTotal) != 0 && mGrandTotal != nullptr) *mGrandTotal = N;
  return failures;
}

IContingencyTable* MakeIContingencyTable(unsigned columns, unsigned rows, unsigned mask,
                                         int* msgCode) {
  ContingencyTable* table = nullptr;
  int code = qelOk;
  try {
    table = new ContingencyTable(columns, rows, mask);
    code = table->GetMsgCode();
  } catch (std::bad_alloc const&) {
    code = qelFailOutOfMemory;
  }
  if (msgCode != nullptr) *msgCode = code;
  if (code == qelFailOutOfMemory) {
    delete table;
    return nullptr;
  }
  return table;
}

void DeleteIContingencyTable(IContingencyTable** table) {
  if (table == nullptr) return;
  delete *table;
  *table = nullptr;
}

}  // namespace qel
