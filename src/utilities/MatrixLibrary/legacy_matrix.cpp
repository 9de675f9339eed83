// The polymorphic matrices: generic algorithms over virtual element access,
// and the packed symmetric and upper triangular layouts.
#include "utilities/MatrixLibrary/legacy_matrix.h"

#include <cmath>
#include <stdexcept>
#include <utility>

#include "utilities/MatrixLibrary/cholesky_row_form.h"

namespace qel {

namespace {

int nonNegative(int n) {
  return n < 0 ? 0 : n;
}

std::size_t packedSize(int order) {
  const auto m = static_cast<std::size_t>(nonNegative(order));
  return m * (m + 1) / 2;
}

}  // namespace

// ---------------------------------------------------------------- matrix ---

template <class T>
matrix<T>::matrix() : m_(0), n_(0), mn_(0), zero_(T()) {}

template <class T>
matrix<T>::matrix(int rows, int cols, const T& value)
    : m_(nonNegative(rows)), n_(nonNegative(cols)), mn_(m_ * n_), zero_(T()), v_(mn_, value) {}

template <class T>
matrix<T>::matrix(const matrix& other) : m_(0), n_(0), mn_(0), zero_(T()) {
  initialize(other.m_, other.n_);
  copyMatrix(other);
}

template <class T>
matrix<T>::matrix(Packed, int order, std::size_t stored, const T& value)
    : m_(nonNegative(order)),
      n_(m_),
      mn_(static_cast<int>(stored)),
      zero_(T()),
      v_(stored, value) {}

template <class T>
matrix<T>::~matrix() {}

template <class T>
T& matrix<T>::operator()(int i, int j) {
  return v_[static_cast<std::size_t>(i) * n_ + j];
}

template <class T>
const T& matrix<T>::operator()(int i, int j) const {
  return v_[static_cast<std::size_t>(i) * n_ + j];
}

template <class T>
void matrix<T>::copyMatrix(const matrix& other) {
  for (int i = 0; i < m_; ++i) {
    for (int j = 0; j < n_; ++j) (*this)(i, j) = other(i, j);
  }
}

template <class T>
void matrix<T>::destroy() {
  std::vector<T>().swap(v_);
  m_ = n_ = mn_ = 0;
}

template <class T>
bool matrix<T>::isRowMajor() const {
  return v_.size() == static_cast<std::size_t>(m_) * static_cast<std::size_t>(n_);
}

template <class T>
void matrix<T>::initialize(int rows, int cols) {
  m_ = nonNegative(rows);
  n_ = nonNegative(cols);
  mn_ = m_ * n_;
  v_.assign(static_cast<std::size_t>(mn_), T());
}

template <class T>
matrix<T>& matrix<T>::operator=(const matrix& other) {
  if (this == &other) return *this;
  if (m_ != other.m_ || n_ != other.n_) {
    destroy();
    initialize(other.m_, other.n_);
  }
  copyMatrix(other);
  return *this;
}

template <class T>
matrix<T> matrix<T>::transpose() const {
  matrix result(n_, m_);
  for (int i = 0; i < m_; ++i) {
    for (int j = 0; j < n_; ++j) result(j, i) = (*this)(i, j);
  }
  return result;
}

template <class T>
matrix<T> matrix<T>::delRow(int i) const {
  if (i < 0 || i >= m_) return matrix(*this);
  matrix result(m_ - 1, n_);
  for (int r = 0, to = 0; r < m_; ++r) {
    if (r == i) continue;
    for (int c = 0; c < n_; ++c) result(to, c) = (*this)(r, c);
    ++to;
  }
  return result;
}

template <class T>
matrix<T> matrix<T>::delCol(int j) const {
  if (j < 0 || j >= n_) return matrix(*this);
  matrix result(m_, n_ - 1);
  for (int r = 0; r < m_; ++r) {
    for (int c = 0, to = 0; c < n_; ++c) {
      if (c != j) result(r, to++) = (*this)(r, c);
    }
  }
  return result;
}

template <class T>
matrix<T>& matrix<T>::removeRow(int i) {
  if (i < 0 || i >= m_ || !isRowMajor()) return *this;
  const auto first = v_.begin() + static_cast<std::ptrdiff_t>(i) * n_;
  v_.erase(first, first + n_);
  --m_;
  mn_ = m_ * n_;
  return *this;
}

template <class T>
matrix<T>& matrix<T>::removeCol(int j) {
  if (j < 0 || j >= n_ || !isRowMajor()) return *this;
  // From the last row up, so that the earlier positions stay valid.
  for (int r = m_ - 1; r >= 0; --r) {
    v_.erase(v_.begin() + static_cast<std::ptrdiff_t>(r) * n_ + j);
  }
  --n_;
  mn_ = m_ * n_;
  return *this;
}

template <class T>
matrix<T>& matrix<T>::insertRow(int i, const T& value) {
  return insertRow(i, std::vector<T>(static_cast<std::size_t>(n_), value));
}

template <class T>
matrix<T>& matrix<T>::insertRow(int i, const std::vector<T>& row) {
  if (row.size() != static_cast<std::size_t>(n_)) {
    throw std::domain_error("addRow\trow vector must be of same order");
  }
  if (i < 0 || i > m_ || !isRowMajor()) return *this;
  v_.reserve(v_.size() + row.size());
  v_.insert(v_.begin() + static_cast<std::ptrdiff_t>(i) * n_, row.begin(), row.end());
  ++m_;
  mn_ = m_ * n_;
  return *this;
}

template <class T>
matrix<T>& matrix<T>::insertCol(int j, const T& value) {
  return insertCol(j, std::vector<T>(static_cast<std::size_t>(m_), value));
}

template <class T>
matrix<T>& matrix<T>::insertCol(int j, const std::vector<T>& column) {
  if (column.size() != static_cast<std::size_t>(m_)) {
    throw std::domain_error("addCol column vector must be of same order");
  }
  if (j < 0 || j > n_ || !isRowMajor()) return *this;
  v_.reserve(v_.size() + column.size());
  for (int r = m_ - 1; r >= 0; --r) {
    v_.insert(v_.begin() + static_cast<std::ptrdiff_t>(r) * n_ + j, column[r]);
  }
  ++n_;
  mn_ = m_ * n_;
  return *this;
}

template <class T>
matrix<T> matrix<T>::operator*(const std::vector<T>& x) const {
  if (static_cast<std::size_t>(n_) != x.size()) {
    throw std::domain_error("matrix and vector multiplication: incompatible orders");
  }
  matrix result(m_, 1);
  for (int i = 0; i < m_; ++i) {
    T sum = T();
    for (int j = 0; j < n_; ++j) sum += (*this)(i, j) * x[j];
    result(i, 0) = sum;
  }
  return result;
}

template <class T>
matrix<T>& matrix<T>::operator+=(const std::vector<T>& x) {
  if (n_ != 1 || static_cast<std::size_t>(m_) != x.size()) {
    throw std::domain_error("op+= matrix and vector must be of same order");
  }
  for (int i = 0; i < m_; ++i) (*this)(i, 0) += x[i];
  return *this;
}

template <class T>
matrix<T> matrix<T>::operator+(const std::vector<T>& x) const {
  matrix result(*this);
  result += x;
  return result;
}

template <class T>
matrix<T>::operator std::vector<T>() const {
  if (n_ != 1) throw std::domain_error("vector cast: result not a vector");
  std::vector<T> result(static_cast<std::size_t>(m_));
  for (int i = 0; i < m_; ++i) result[i] = (*this)(i, 0);
  return result;
}

template <class T>
T matrix<T>::DotProduct(int i, int j, int count) const {
  if (count > m_) {
    throw std::domain_error("matrix::number of products greater than dimension");
  }
  T sum = T();
  for (int k = 0; k < count; ++k) sum += (*this)(k, i) * (*this)(k, j);
  return sum;
}

// --------------------------------------------------------------- Smatrix ---

template <class T>
Smatrix<T>::Smatrix() : matrix<T>(typename matrix<T>::Packed(), 0, 0, T()) {}

template <class T>
Smatrix<T>::Smatrix(int order, const T& value)
    : matrix<T>(typename matrix<T>::Packed(), order, packedSize(order), value) {}

template <class T>
Smatrix<T>::Smatrix(int order, const T* packedLower)
    : matrix<T>(typename matrix<T>::Packed(), order, packedSize(order), T()) {
  for (std::size_t k = 0; k < this->v_.size(); ++k) this->v_[k] = packedLower[k];
}

template <class T>
Smatrix<T>::Smatrix(const Smatrix& other)
    : matrix<T>(typename matrix<T>::Packed(), other.m_, other.v_.size(), T()) {
  this->v_ = other.v_;
}

template <class T>
Smatrix<T>& Smatrix<T>::operator=(const Smatrix& other) {
  this->m_ = other.m_;
  this->n_ = other.n_;
  this->mn_ = other.mn_;
  this->v_ = other.v_;
  return *this;
}

template <class T>
Smatrix<T>::~Smatrix() {}

template <class T>
T& Smatrix<T>::operator()(int i, int j) {
  if (i < j) std::swap(i, j);
  return this->v_[static_cast<std::size_t>(i) * (i + 1) / 2 + j];
}

template <class T>
const T& Smatrix<T>::operator()(int i, int j) const {
  if (i < j) std::swap(i, j);
  return this->v_[static_cast<std::size_t>(i) * (i + 1) / 2 + j];
}

template <class T>
matrix<T>& Smatrix<T>::removeRow(int) {
  return *this;
}

template <class T>
matrix<T>& Smatrix<T>::removeCol(int) {
  return *this;
}

template <class T>
matrix<T>& Smatrix<T>::insertRow(int, const T&) {
  return *this;
}

template <class T>
matrix<T>& Smatrix<T>::insertRow(int, const std::vector<T>&) {
  return *this;
}

template <class T>
matrix<T>& Smatrix<T>::insertCol(int, const T&) {
  return *this;
}

template <class T>
matrix<T>& Smatrix<T>::insertCol(int, const std::vector<T>&) {
  return *this;
}

template <class T>
UTmatrix<T> Smatrix<T>::CholeskyDecomp() const {
  // A NaN would slip through the test d <= 0, and an infinity would raise the
  // invalid operation in the products: neither belongs to a positive definite
  // matrix.
  for (const T& x : this->v_) {
    if (!std::isfinite(x)) throw std::domain_error("Smatrix: matrix is not positive definite");
  }
  int failedRow = -1;
  T residual = T();
  UTmatrix<T> factor = mSmatrixToUTmatrix(*this).CholeskyDecomp(0, &failedRow, &residual);
  if (failedRow != -1) throw std::domain_error("Smatrix: matrix is not positive definite");
  return factor;
}

// -------------------------------------------------------------- UTmatrix ---

template <class T>
UTmatrix<T>::UTmatrix() : matrix<T>(typename matrix<T>::Packed(), 0, 0, T()) {}

template <class T>
UTmatrix<T>::UTmatrix(int order, const T& value)
    : matrix<T>(typename matrix<T>::Packed(), order, packedSize(order), value) {}

template <class T>
UTmatrix<T>::UTmatrix(const UTmatrix& other)
    : matrix<T>(typename matrix<T>::Packed(), other.m_, other.v_.size(), T()) {
  this->v_ = other.v_;
}

template <class T>
UTmatrix<T>& UTmatrix<T>::operator=(const UTmatrix& other) {
  this->m_ = other.m_;
  this->n_ = other.n_;
  this->mn_ = other.mn_;
  this->v_ = other.v_;
  return *this;
}

template <class T>
UTmatrix<T>::~UTmatrix() {}

template <class T>
T& UTmatrix<T>::operator()(int i, int j) {
  if (i > j) {
    this->zero_ = T();
    return this->zero_;
  }
  return this
      ->v_[static_cast<std::size_t>(i) * this->m_ - static_cast<std::size_t>(i) * (i + 1) / 2 + j];
}

template <class T>
const T& UTmatrix<T>::operator()(int i, int j) const {
  if (i > j) {
    this->zero_ = T();
    return this->zero_;
  }
  return this
      ->v_[static_cast<std::size_t>(i) * this->m_ - static_cast<std::size_t>(i) * (i + 1) / 2 + j];
}

template <class T>
UTmatrix<T> UTmatrix<T>::CholeskyDecomp(int start, int* failedRow, T* residual) const {
  const int m = this->m_;
  if (start > m) throw std::domain_error("UTmatrix: starting row greater than dimension");
  if (start < 0) start = 0;
  UTmatrix u(*this);
  T sumOfSquares = T();
  const int failed = cholesky_detail::choleskyPackedUpper(u.v_, m, start, &sumOfSquares);
  if (failedRow) *failedRow = failed;
  if (residual) *residual = sumOfSquares;
  return u;
}

template <class T>
UTmatrix<T> mSmatrixToUTmatrix(const Smatrix<T>& s) {
  UTmatrix<T> u(s.order());
  for (int i = 0; i < s.order(); ++i) {
    for (int j = i; j < s.order(); ++j) u(i, j) = s(i, j);
  }
  return u;
}

template class matrix<double>;
template class Smatrix<double>;
template class UTmatrix<double>;
template UTmatrix<double> mSmatrixToUTmatrix(const Smatrix<double>&);

}  // namespace qel
