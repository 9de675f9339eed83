// Crout's LU factorisation with implicit scaling (Press et al., Numerical
// Recipes, ludcmp/lubksb), arranged so that every inner loop runs along a
// contiguous row and in panels (see factorPanel). The pivot of every column
// is chosen from the same fully reduced candidates as in the
// column-by-column order.
#include "utilities/MatrixLibrary/matrix_ludecomposition.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstring>
#include <utility>

#include "utilities/LYNExceptions.h"
#include "utilities/MathUtilities.h"
#include "utilities/MatrixLibrary/simd_pair.h"

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

// Columns are factored in panels of kPanel. Within a panel each column is
// pivoted and its multipliers update the rest of the panel; the panel's rows
// then update the block row to its right and, once, the trailing matrix.
// Every element receives its products in the same order as in the plain
// column-by-column elimination; only the order of the loops changes, so that
// a trailing row is read once a panel instead of once a column.
constexpr int kPanel = 32;
constexpr int kChunk = 8;

std::size_t at(int i, int j, int n) {
  return static_cast<std::size_t>(i) * n + j;
}

bool factorPanel(double* v, int n, int j0, int j1, std::vector<double>& scale,
                 std::vector<int>& perm, double& parity) {
  for (int j = j0; j < j1; ++j) {
    const int pivot = choosePivot(v, n, j, scale);
    double* rowJ = v + at(j, 0, n);
    if (pivot != j) {
      std::swap_ranges(rowJ, rowJ + n, v + at(pivot, 0, n));
      parity = -parity;
      scale[static_cast<std::size_t>(pivot)] = scale[static_cast<std::size_t>(j)];
    }
    perm[static_cast<std::size_t>(j)] = pivot;
    if (negligible(rowJ[j])) return false;
    if (j == n - 1) break;
    const double reciprocal = 1.0 / rowJ[j];
    for (int i = j + 1; i < n; ++i) {
      double* rowI = v + at(i, 0, n);
      const double multiplier = rowI[j] * reciprocal;
      rowI[j] = multiplier;
      for (int k = j + 1; k < j1; ++k) rowI[k] -= multiplier * rowJ[k];
    }
  }
  return true;
}

// Rows j0..j1-1, columns from j1: the unit lower panel block applied.
void solveBlockRow(double* v, int n, int j0, int j1) {
  for (int j = j0; j < j1; ++j) {
    const double* rowJ = v + at(j, 0, n);
    for (int r = j + 1; r < j1; ++r) {
      double* rowR = v + at(r, 0, n);
      const double multiplier = rowR[j];
      simd::subtractMultiple(rowR + j1, multiplier, rowJ + j1, n - j1);
    }
  }
}

using simd::load;
using simd::Pair;
using simd::store;

// Columns c..c+7 of rows i and i+1 (rows ends at i + 1 < n or not).
void updateChunk(double* v, int n, int j0, int width, int i, bool twoRows, int c) {
  double* row0 = v + at(i, 0, n);
  double* row1 = twoRows ? row0 + n : row0;
  Pair a0 = load(row0 + c), a1 = load(row0 + c + 2), a2 = load(row0 + c + 4),
       a3 = load(row0 + c + 6);
  Pair b0 = load(row1 + c), b1 = load(row1 + c + 2), b2 = load(row1 + c + 4),
       b3 = load(row1 + c + 6);
  for (int k = 0; k < width; ++k) {
    const double* u = v + at(j0 + k, c, n);
    const Pair u0 = load(u), u1 = load(u + 2), u2 = load(u + 4), u3 = load(u + 6);
    const Pair m0 = {row0[j0 + k], row0[j0 + k]};
    const Pair m1 = {row1[j0 + k], row1[j0 + k]};
    a0 -= m0 * u0;
    a1 -= m0 * u1;
    a2 -= m0 * u2;
    a3 -= m0 * u3;
    b0 -= m1 * u0;
    b1 -= m1 * u1;
    b2 -= m1 * u2;
    b3 -= m1 * u3;
  }
  if (twoRows) {
    store(row1 + c, b0);
    store(row1 + c + 2, b1);
    store(row1 + c + 4, b2);
    store(row1 + c + 6, b3);
  }
  store(row0 + c, a0);
  store(row0 + c + 2, a1);
  store(row0 + c + 4, a2);
  store(row0 + c + 6, a3);
}

// a(i, c) -= sum over k in the panel of a(i, k) a(k, c), for i, c >= j1, in
// the order of k; two rows by eight columns a step are held in registers,
// over column blocks whose panel rows stay in the first-level cache.
void updateTrailing(double* v, int n, int j0, int j1) {
  const int width = j1 - j0;
  constexpr int kBlock = 128;
  for (int c0 = j1; c0 < n; c0 += kBlock) {
    const int c1 = std::min(n, c0 + kBlock);
    for (int i = j1; i < n; i += 2) {
      const bool twoRows = i + 1 < n;
      int c = c0;
      for (; c + kChunk <= c1; c += kChunk) updateChunk(v, n, j0, width, i, twoRows, c);
      for (int r = i; r <= (twoRows ? i + 1 : i); ++r) {
        double* rowR = v + at(r, 0, n);
        for (int cc = c; cc < c1; ++cc) {
          double acc = rowR[cc];
          for (int k = 0; k < width; ++k) acc -= rowR[j0 + k] * v[at(j0 + k, cc, n)];
          rowR[cc] = acc;
        }
      }
    }
  }
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
  for (int j0 = 0; j0 < n; j0 += kPanel) {
    const int j1 = std::min(n, j0 + kPanel);
    if (!factorPanel(v, n, j0, j1, scale, *row_perm, *parity)) {
      singularResult(a);
      return false;
    }
    solveBlockRow(v, n, j0, j1);
    updateTrailing(v, n, j0, j1);
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

// All columns at once, by rows: the exchanges applied to the rows of X,
// then the forward and back substitutions as row updates, each element
// receiving its products in the same order as in the one-column solve.
bool LUDecomposition::Solve(const matrix<double>& B, matrix<double>* X) const {
  QEL_ALLEGE(X);
  QEL_ALLEGE(&B != X);
  if (singular_) {
    X->ResizeStorage(0, 0, 0.0);
    return false;
  }
  if (B.rowCount() != lu_.rowCount())
    throw MatrixException("LU solve: matrix and vector have incompatible dimensions");
  const matrix<double>& lhs = lu_;
  const int n = B.rowCount();
  const int columns = B.colCount();
  *X = B;
  double* x = X->data();
  const auto row = [&](int i) { return x + static_cast<std::size_t>(i) * columns; };
  for (int i = 0; i < n; ++i) {
    const int ip = perm_[static_cast<std::size_t>(i)];
    if (ip != i) std::swap_ranges(row(i), row(i) + columns, row(ip));
    const double* l = lhs.data() + static_cast<std::size_t>(i) * n;
    for (int j = 0; j < i; ++j) simd::subtractMultiple(row(i), l[j], row(j), columns);
  }
  for (int i = n - 1; i >= 0; --i) {
    const double* u = lhs.data() + static_cast<std::size_t>(i) * n;
    for (int j = i + 1; j < n; ++j) simd::subtractMultiple(row(i), u[j], row(j), columns);
    if (lhs(i, i) == 0.0) allege::AllegeFailure("lhs(i,i)", __FILE__, __LINE__);
    double* xi = row(i);
    for (int c = 0; c < columns; ++c) xi[c] /= u[i];
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
