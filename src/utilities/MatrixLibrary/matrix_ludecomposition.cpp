// Crout's LU factorisation with implicit scaling (Press et al., Numerical
// Recipes, ludcmp/lubksb), arranged so that every inner loop runs along a
// contiguous row: after the pivot of column j is fixed, its multipliers
// update the rows below at once. Each element receives the same products as
// in the column-by-column order, and the pivot of every column is chosen from
// the same fully reduced candidates.
#include "utilities/MatrixLibrary/matrix_ludecomposition.h"

#include <cmath>
#include <cstddef>
#include <utility>

#include "utilities/LYNExceptions.h"
#include "utilities/MathUtilities.h"

namespace qel {
namespace matrix_library {

namespace {

bool negligible(double value) {
  return mEqualWithinFuzz(0.0, value, 1.0);
}

// Reciprocal of the largest magnitude of each row; false when a row is
// negligible. NaN entries do not count (a row of NaN is negligible).
bool CalculateScaling(const double* a, int n, std::vector<double>& scale) {
  for (int i = 0; i < n; ++i) {
    const double* row = a + static_cast<std::size_t>(i) * n;
    double big0 = 0.0;
    double big1 = 0.0;
    int j = 0;
    for (; j + 1 < n; j += 2) {
      if (std::fabs(row[j]) > big0) big0 = std::fabs(row[j]);
      if (std::fabs(row[j + 1]) > big1) big1 = std::fabs(row[j + 1]);
    }
    if (j < n && std::fabs(row[j]) > big0) big0 = std::fabs(row[j]);
    const double big = big0 > big1 ? big0 : big1;
    if (negligible(big)) return false;
    scale[static_cast<std::size_t>(i)] = 1.0 / big;
  }
  return true;
}

// Row of the largest scaled candidate |a(i, j)| scale(i), i >= j; a later row
// wins a tie.
int choosePivot(const double* a, int n, int j, const std::vector<double>& scale) {
  int pivot = j;
  double best = -1.0;
  for (int i = j; i < n; ++i) {
    const double candidate = std::fabs(a[static_cast<std::size_t>(i) * n + j]) * scale[i];
    if (candidate >= best) {
      best = candidate;
      pivot = i;
    }
  }
  return pivot;
}

void singularResult(matrix<double>& a) {
  a.ResizeStorage(0, 0, 0.0);
}

}  // namespace

bool LUDecompSafeIterator(matrix<double>& a, std::vector<int>* row_perm, double* parity) {
  QEL_ALLEGE(row_perm);
  QEL_ALLEGE(parity);
  if (a.rowCount() != a.colCount())
    throw MatrixException("LU Decomp is defined for only square matrices");
  const int n = a.rowCount();
  *parity = 1.0;
  row_perm->assign(static_cast<std::size_t>(n), 0);
  if (n == 1) {
    if (a(0, 0) == 0.0) {
      singularResult(a);
      return false;
    }
    return true;
  }
  double* v = a.data();
  std::vector<double> scale(static_cast<std::size_t>(n));
  if (!CalculateScaling(v, n, scale)) {
    singularResult(a);
    return false;
  }
  for (int j = 0; j < n; ++j) {
    const int pivot = choosePivot(v, n, j, scale);
    double* rowJ = v + static_cast<std::size_t>(j) * n;
    if (pivot != j) {
      std::swap_ranges(rowJ, rowJ + n, v + static_cast<std::size_t>(pivot) * n);
      *parity = -*parity;
      scale[static_cast<std::size_t>(pivot)] = scale[static_cast<std::size_t>(j)];
    }
    (*row_perm)[static_cast<std::size_t>(j)] = pivot;
    if (negligible(rowJ[j])) {
      singularResult(a);
      return false;
    }
    if (j == n - 1) break;
    const double reciprocal = 1.0 / rowJ[j];
    for (int i = j + 1; i < n; ++i) {
      double* rowI = v + static_cast<std::size_t>(i) * n;
      const double multiplier = rowI[j] * reciprocal;
      rowI[j] = multiplier;
      if (multiplier == 0.0) continue;
      for (int k = j + 1; k < n; ++k) rowI[k] -= multiplier * rowJ[k];
    }
  }
  return true;
}

bool LUDecompTemplate(const matrix<double>& a, matrix<double>* lu, std::vector<int>* row_perm,
                      double* parity) {
  QEL_ALLEGE(lu);
  *lu = a;
  return LUDecompSafeIterator(*lu, row_perm, parity);
}

LUDecomposition::LUDecomposition(const matrix<double>& a) : singular_(false), parity_(1.0) {
  singular_ = !LUDecompTemplate(a, &lu_, &perm_, &parity_);
}

bool LUDecomposition::Determinant(double* result) const {
  QEL_ALLEGE(result);
  if (singular_) {
    *result = 0.0;
    return false;
  }
  double product = parity_;
  for (int i = 0; i < lu_.rowCount(); ++i) product *= lu_(i, i);
  *result = product;
  return true;
}

double LUDecomposition::DeterminantWithThrow() const {
  double result = 0.0;
  if (!Determinant(&result)) throw MatrixSingular();
  return result;
}

// Forward substitution applying the exchanges in turn, starting at the first
// nonzero of b, then back substitution from the last row.
void LUDecomposition::backSubstitute(std::vector<double>& x) const {
  const matrix<double>& lhs = lu_;
  const int n = lhs.rowCount();
  int first = -1;
  for (int i = 0; i < n; ++i) {
    const auto ip = static_cast<std::size_t>(perm_[static_cast<std::size_t>(i)]);
    double sum = x[ip];
    x[ip] = x[static_cast<std::size_t>(i)];
    if (first >= 0) {
      const double* row = lhs.data() + static_cast<std::size_t>(i) * n;
      for (int j = first; j < i; ++j) sum -= row[j] * x[static_cast<std::size_t>(j)];
    } else if (sum != 0.0) {
      first = i;
    }
    x[static_cast<std::size_t>(i)] = sum;
  }
  for (int i = n - 1; i >= 0; --i) {
    const double* row = lhs.data() + static_cast<std::size_t>(i) * n;
    double sum = x[static_cast<std::size_t>(i)];
    for (int j = i + 1; j < n; ++j) sum -= row[j] * x[static_cast<std::size_t>(j)];
    if (lhs(i, i) == 0.0) allege::AllegeFailure("lhs(i,i)", __FILE__, __LINE__);
    x[static_cast<std::size_t>(i)] = sum / row[i];
  }
}

bool LUDecomposition::Solve(const std::vector<double>& b, std::vector<double>* x) const {
  QEL_ALLEGE(x);
  if (singular_) {
    x->clear();
    return false;
  }
  if (static_cast<int>(b.size()) != lu_.rowCount())
    throw MatrixException("LU solve: matrix and vector have incompatible dimensions");
  *x = b;
  backSubstitute(*x);
  return true;
}

bool LUDecomposition::Solve(const matrix<double>& B, matrix<double>* X) const {
  QEL_ALLEGE(X);
  QEL_ALLEGE(&B != X);
  if (singular_) {
    X->ResizeStorage(0, 0, 0.0);
    return false;
  }
  if (B.rowCount() != lu_.rowCount())
    throw MatrixException("LU solve: matrix and vector have incompatible dimensions");
  const int n = B.rowCount();
  const int columns = B.colCount();
  X->ResizeStorage(n, columns, 0.0);
  std::vector<double> column(static_cast<std::size_t>(n));
  for (int j = 0; j < columns; ++j) {
    for (int i = 0; i < n; ++i) column[static_cast<std::size_t>(i)] = B(i, j);
    backSubstitute(column);
    for (int i = 0; i < n; ++i) (*X)(i, j) = column[static_cast<std::size_t>(i)];
  }
  return true;
}

bool LUDecomposition::Inverse(matrix<double>* result) const {
  QEL_ALLEGE(result);
  const int n = lu_.rowCount();
  matrix<double> identity(n, n, 0.0);
  for (int i = 0; i < n; ++i) identity(i, i) = 1.0;
  return Solve(identity, result);
}

}  // namespace matrix_library
}  // namespace qel
