// Members of the value matrices: construction, conversion, storage and the
// element-wise updates of the general matrix.
#include "utilities/MatrixLibrary/matrix_impl.h"

#include <algorithm>
#include <utility>

#include "utilities/MathUtilities.h"
#include "utilities/MatrixLibrary/matrix_functions.h"

namespace qel {
namespace matrix_library {

MatrixException::~MatrixException() {}
MatrixSingular::~MatrixSingular() {}

void checkEqualDimensions(const char* label, int rowsA, int colsA, int rowsB, int colsB) {
  if (rowsA != rowsB) throw MatrixException(std::string(label) + " : row counts are different");
  if (colsA != colsB) throw MatrixException(std::string(label) + " : col counts are different");
}

void checkMultiplyDimensions(int colsA, int rowsB) {
  if (colsA != rowsB) throw MatrixException("Matrix multiplication: incompatible orders");
}

// ------------------------------------------------------------- matrix -------

template <class T>
matrix<T>::matrix(const Dmatrix<T>& d) : matrix(d.size(), d.size(), T()) {
  for (int i = 0; i < m_; ++i) (*this)(i, i) = d(i, i);
}

template <class T>
matrix<T>::matrix(const Smatrix<T>& s) : matrix(s.size(), s.size(), T()) {
  for (int i = 0; i < m_; ++i) {
    for (int j = 0; j <= i; ++j) (*this)(i, j) = (*this)(j, i) = s(i, j);
  }
}

template <class T>
matrix<T>::matrix(const UTmatrix<T>& u) : matrix(u.size(), u.size(), T()) {
  for (int i = 0; i < m_; ++i) {
    for (int j = i; j < n_; ++j) (*this)(i, j) = u(i, j);
  }
}

template <class T>
matrix<T>::matrix(const std::vector<T>& v, int cols) : matrix() {
  if (cols <= 0) cols = 1;
  if (v.size() % static_cast<std::size_t>(cols) != 0)
    throw MatrixException("matrix: vector length is not a multiple of the column count");
  m_ = static_cast<int>(v.size() / static_cast<std::size_t>(cols));
  n_ = v.empty() ? 0 : cols;
  mn_ = static_cast<int>(v.size());
  v_ = v;
}

template <class T>
matrix<T>& matrix<T>::operator=(const std::vector<T>& v) {
  m_ = static_cast<int>(v.size());
  n_ = v.empty() ? 0 : 1;
  mn_ = m_;
  v_ = v;
  return *this;
}

template <class T>
void matrix<T>::Grow(std::size_t size, const T& value) {
  v_.reserve(size);
  v_.resize(size, value);
}

template <class T>
void matrix<T>::ResizeStorage(int rows, int cols, const T& value) {
  m_ = rows < 0 ? 0 : rows;
  n_ = cols < 0 ? 0 : cols;
  mn_ = m_ * n_;
  const auto size = static_cast<std::size_t>(mn_);
  if (size > v_.size()) {
    Grow(size, value);
  } else {
    v_.resize(size);
  }
  QEL_ALLEGE(mn_ == static_cast<int>(v_.size()));
  std::fill(v_.begin(), v_.end(), value);
}

template <class T>
std::vector<T> matrix<T>::getRowVector(int i) const {
  const auto first = v_.begin() + static_cast<std::ptrdiff_t>(i) * n_;
  return std::vector<T>(first, first + n_);
}

template <class T>
std::vector<T> matrix<T>::getColVector(int j) const {
  std::vector<T> column(static_cast<std::size_t>(m_));
  for (int i = 0; i < m_; ++i) column[static_cast<std::size_t>(i)] = (*this)(i, j);
  return column;
}

template <class T>
matrix<T> matrix<T>::transpose() const {
  if (m_ == 1 || n_ == 1) {
    matrix t(*this);
    std::swap(t.m_, t.n_);
    return t;
  }
  matrix t(n_, m_, T());
  // Blocks of 8 rows keep both the read and the written rows in cache.
  for (int i0 = 0; i0 < m_; i0 += 8) {
    const int i1 = std::min(m_, i0 + 8);
    for (int j = 0; j < n_; ++j) {
      for (int i = i0; i < i1; ++i) t(j, i) = (*this)(i, j);
    }
  }
  return t;
}

template <class T>
Smatrix<T> matrix<T>::ConvertToSmatrix() const {
  const int rows = m_;
  const int cols = n_;
  QEL_ALLEGE(rows == cols);
  Smatrix<T> s(rows);
  for (int i = 0; i < rows; ++i) {
    for (int j = 0; j <= i; ++j) {
      if (!mEqualWithinFuzz((*this)(i, j), (*this)(j, i), 0.0))
        throw MatrixException("Smatrix cast: result not a symmetric matrix");
      s(i, j) = (*this)(i, j);
    }
  }
  return s;
}

template <class T>
matrix<T>& matrix<T>::operator+=(const matrix& other) {
  QEL_ALLEGE(m_ == other.m_ && n_ == other.n_);
  QEL_ALLEGE(v_.size() == other.v_.size());
  for (std::size_t k = 0; k < v_.size(); ++k) v_[k] += other.v_[k];
  return *this;
}

template <class T>
matrix<T>& matrix<T>::operator-=(const matrix& other) {
  QEL_ALLEGE(m_ == other.m_ && n_ == other.n_);
  QEL_ALLEGE(v_.size() == other.v_.size());
  for (std::size_t k = 0; k < v_.size(); ++k) v_[k] -= other.v_[k];
  return *this;
}

template <class T>
matrix<T> matrix<T>::operator+(const matrix& other) const {
  matrix sum(*this);
  return sum += other;
}

template <class T>
matrix<T> matrix<T>::operator-(const matrix& other) const {
  matrix difference(*this);
  return difference -= other;
}

template <class T>
matrix<T>& matrix<T>::operator*=(double k) {
  for (T& x : v_) x *= k;
  return *this;
}

template <class T>
int matrix<T>::EigenSystems(std::vector<T>& values, matrix& vectors) const {
  return matrix_library::EigenSystems(*this, values, vectors);
}

// ------------------------------------------------------------ Smatrix -------

template <class T>
std::vector<T> Smatrix<T>::getRowVector(int i) const {
  std::vector<T> row(static_cast<std::size_t>(m_));
  for (int j = 0; j < m_; ++j) row[static_cast<std::size_t>(j)] = (*this)(i, j);
  return row;
}

// ---------------------------------------------------------- conversions -----

UTmatrix<double> SmatrixToUTmatrix(const Smatrix<double>& s) {
  UTmatrix<double> u(s.size());
  for (int i = 0; i < s.size(); ++i) {
    for (int j = i; j < s.size(); ++j) u(i, j) = s(i, j);
  }
  return u;
}

Smatrix<double> mUTmatrixToSmatrix(const UTmatrix<double>& u) {
  Smatrix<double> s(u.size());
  for (int i = 0; i < u.size(); ++i) {
    for (int j = i; j < u.size(); ++j) s(i, j) = u(i, j);
  }
  return s;
}

template class matrix<double>;
template class Smatrix<double>;
template class UTmatrix<double>;
template class Dmatrix<double>;

}  // namespace matrix_library
}  // namespace qel
