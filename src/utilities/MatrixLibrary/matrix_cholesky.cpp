// Cholesky factor, its inverse and back substitution on packed storage, and
// the inverse and determinant of the symmetric and diagonal kinds.
#include <cmath>

#include "utilities/MatrixLibrary/cholesky_row_form.h"
#include "utilities/MatrixLibrary/matrix_functions.h"
#include "utilities/MatrixLibrary/matrix_ludecomposition.h"

namespace qel {
namespace matrix_library {

UMat CholeskyDecomp(const UMat& u, int start, int* failedRow, double* residual) {
  const int m = u.size();
  if (start > m) throw MatrixException("UTmatrix: starting row greater than dimension");
  if (start < 0) start = 0;
  UMat factor(u);
  double sumOfSquares = 0.0;
  const int failed =
      cholesky_detail::choleskyPackedUpper(factor.storage(), m, start, &sumOfSquares);
  if (failedRow) *failedRow = failed;
  if (residual) *residual = sumOfSquares;
  return factor;
}

bool CholeskyDecomp(const SMat& a, UMat* result) {
  QEL_ALLEGE(result);
  int failedRow = -1;
  double residual = 0.0;
  *result = CholeskyDecomp(SmatrixToUTmatrix(a), 0, &failedRow, &residual);
  // A NaN pivot passes the test d <= 0; such a factor is no factor.
  bool finite = true;
  for (double x : result->storage()) finite = finite && std::isfinite(x);
  if (failedRow == -1 && finite) return true;
  result->resize(0);
  return false;
}

UMat CholeskyDecompWithThrow(const SMat& a) {
  UMat factor;
  if (!CholeskyDecomp(a, &factor)) throw MatrixSingular();
  return factor;
}

namespace {

// X = U^{-1} in place on the packed rows, from the last row up: row i of X
// is -(1/u(i,i)) times the sum over k > i of u(i,k) (row k of X), with
// 1/u(i,i) on the diagonal. Every update runs along contiguous packed rows.
void invertUpperInPlace(std::vector<double>& v, int m) {
  std::vector<double> row(static_cast<std::size_t>(m));
  for (int i = m - 1; i >= 0; --i) {
    double* ui = v.data() + packedIndexUpper(i, i, m);
    const double reciprocal = 1.0 / ui[0];
    for (int j = i + 1; j < m; ++j) row[static_cast<std::size_t>(j)] = 0.0;
    for (int k = i + 1; k < m; ++k) {
      const double factor = ui[k - i];
      const double* xk = v.data() + packedIndexUpper(k, k, m);
      for (int j = k; j < m; ++j) row[static_cast<std::size_t>(j)] += factor * xk[j - k];
    }
    ui[0] = reciprocal;
    for (int j = i + 1; j < m; ++j) ui[j - i] = -reciprocal * row[static_cast<std::size_t>(j)];
  }
}

}  // namespace

SMat CholeskyInverse(const UMat& u) {
  const int m = u.size();
  std::vector<double> x = u.storage();
  invertUpperInPlace(x, m);
  // (U'U)^{-1} = X X': element (i, j), i <= j, is the dot product of the
  // packed rows i and j of X from column j on.
  SMat s(m);
  for (int i = 0; i < m; ++i) {
    const double* xi = x.data() + packedIndexUpper(i, i, m);
    for (int j = i; j < m; ++j) {
      const double* xj = x.data() + packedIndexUpper(j, j, m);
      s(i, j) = cholesky_detail::rowDot(xi + (j - i), xj, m - j);
    }
  }
  return s;
}

Vec CholeskyBackSub(const UMat& u, const Vec& b) {
  const int m = u.size();
  if (m != static_cast<int>(b.size()))
    throw MatrixException("UTmatrix: matrix and vector have incompatible dimensions");
  const std::vector<double>& v = u.storage();
  // U' y = b: y(i) = (b(i) - sum over k < i of u(k,i) y(k)) / u(i,i), done
  // by rows of U: once y(k) is known it is subtracted along packed row k.
  Vec y(b);
  for (int k = 0; k < m; ++k) {
    const double* uk = v.data() + packedIndexUpper(k, k, m);
    y[static_cast<std::size_t>(k)] /= uk[0];
    const double yk = y[static_cast<std::size_t>(k)];
    for (int i = k + 1; i < m; ++i) y[static_cast<std::size_t>(i)] -= uk[i - k] * yk;
  }
  // U x = y from the last row up.
  Vec x(y);
  for (int i = m - 1; i >= 0; --i) {
    const double* ui = v.data() + packedIndexUpper(i, i, m);
    double sum = x[static_cast<std::size_t>(i)];
    for (int j = i + 1; j < m; ++j) sum -= ui[j - i] * x[static_cast<std::size_t>(j)];
    x[static_cast<std::size_t>(i)] = sum / ui[0];
  }
  return x;
}

bool inverse(const SMat& a, SMat* result) {
  QEL_ALLEGE(result);
  UMat factor;
  if (!CholeskyDecomp(a, &factor)) {
    result->resize(0);
    return false;
  }
  *result = CholeskyInverse(factor);
  return true;
}

SMat inverseWithThrow(const SMat& a) {
  SMat result;
  if (!inverse(a, &result)) throw MatrixSingular();
  return result;
}

bool inverse(const DMat& a, DMat* result) {
  QEL_ALLEGE(result);
  DMat r(a.size());
  for (int i = 0; i < a.size(); ++i) {
    if (a(i, i) == 0.0) {
      result->resize(0);
      return false;
    }
    r(i, i) = 1.0 / a(i, i);
  }
  *result = r;
  return true;
}

DMat inverseWithThrow(const DMat& a) {
  DMat result;
  if (!inverse(a, &result)) throw MatrixSingular();
  return result;
}

bool inverse(const Mat& a, Mat* result) {
  QEL_ALLEGE(result);
  return LUDecomposition(a).Inverse(result);
}

Mat inverseWithThrow(const Mat& a) {
  Mat result;
  if (!inverse(a, &result)) throw MatrixSingular();
  return result;
}

bool determinant(const Mat& a, double* result) {
  QEL_ALLEGE(result);
  return LUDecomposition(a).Determinant(result);
}

bool determinant(const SMat& a, double* result) {
  return determinant(Mat(a), result);
}

double determinantWithThrow(const Mat& a) {
  return LUDecomposition(a).DeterminantWithThrow();
}

double determinantWithThrow(const SMat& a) {
  return determinantWithThrow(Mat(a));
}

}  // namespace matrix_library
}  // namespace qel
