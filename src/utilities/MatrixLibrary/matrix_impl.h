// Dense value matrices of qel::matrix_library: a general row-major matrix and
// three square layouts (symmetric packed by lower rows, upper triangular
// packed by rows, diagonal). All hold their elements in a std::vector and copy
// deeply. Element access has no range test. Shape errors are MatrixException
// with fixed words; the ...WithThrow operations raise MatrixSingular.
//
// The free operators, products, quadratic forms and decompositions are in
// matrix_functions.h and matrix_ludecomposition.h.
#ifndef QEL_SRC_UTILITIES_MATRIXLIBRARY_MATRIX_IMPL_H
#define QEL_SRC_UTILITIES_MATRIXLIBRARY_MATRIX_IMPL_H

#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <string>
#include <vector>

#include "utilities/LYNExceptions.h"

namespace qel {
namespace matrix_library {

// Appends "text : value" to trace.txt (diagnostics; nothing calls it in
// normal runs).
using qel::matrix_trace;

class MatrixException : public std::runtime_error {
 public:
  explicit MatrixException(const std::string& what) : std::runtime_error(what) {}
  ~MatrixException() override;
};

// Raised by the ...WithThrow forms; a MatrixException, so that one handler can
// take every failure of the library.
class MatrixSingular : public MatrixException {
 public:
  MatrixSingular() : MatrixException("Matrix is singular") {}
  ~MatrixSingular() override;
};

// Throws MatrixException "<label> : row counts are different" (rows are
// tested first) or "<label> : col counts are different".
void checkEqualDimensions(const char* label, int rowsA, int colsA, int rowsB, int colsB);
// Throws MatrixException "Matrix multiplication: incompatible orders" unless
// colsA == rowsB.
void checkMultiplyDimensions(int colsA, int rowsB);

template <class T>
class Smatrix;
template <class T>
class UTmatrix;
template <class T>
class Dmatrix;

// Elements of a packed triangle of the given order (the diagonal included).
inline std::size_t packedTriangleSize(int order) {
  return order <= 0 ? 0 : static_cast<std::size_t>(order) * (order + 1) / 2;
}
inline std::size_t packedIndexLower(int i, int j) {
  return static_cast<std::size_t>(i) * (i + 1) / 2 + j;
}
inline std::size_t packedIndexUpper(int i, int j, int m) {
  return static_cast<std::size_t>(i) * m - static_cast<std::size_t>(i) * (i + 1) / 2 + j;
}

// General matrix, row-major: element (i, j) is v_[i n_ + j].
template <class T>
class matrix {
 public:
  matrix() : sentinel_(kSentinel), m_(0), n_(0), mn_(0) {}
  matrix(int rows, int cols, const T& value = T()) : sentinel_(kSentinel), m_(0), n_(0), mn_(0) {
    ResizeStorage(rows, cols, value);
  }
  matrix(const matrix&) = default;
  matrix(matrix&&) noexcept = default;
  explicit matrix(const Dmatrix<T>& d);
  explicit matrix(const Smatrix<T>& s);
  explicit matrix(const UTmatrix<T>& u);
  // The elements of v row by row into rows of cols elements; a length that
  // cols does not divide throws MatrixException "matrix: vector length is not
  // a multiple of the column count". cols <= 0 counts as one column.
  matrix(const std::vector<T>& v, int cols);
  ~matrix() = default;

  matrix& operator=(const matrix&) = default;
  matrix& operator=(matrix&&) noexcept = default;
  // A one-column matrix holding v.
  matrix& operator=(const std::vector<T>& v);

  void Initialize(int rows, int cols, const T& value) { ResizeStorage(rows, cols, value); }
  // Sets the dimensions (negative ones count as 0) and fills every element
  // with value.
  void ResizeStorage(int rows, int cols, const T& value);

  T& operator()(int i, int j) { return v_[static_cast<std::size_t>(i) * n_ + j]; }
  const T& operator()(int i, int j) const { return v_[static_cast<std::size_t>(i) * n_ + j]; }
  T* data() { return v_.data(); }
  const T* data() const { return v_.data(); }

  int rowCount() const { return m_; }
  int colCount() const { return n_; }
  bool empty() const { return mn_ == 0; }
  std::vector<T> getRowVector(int i) const;
  std::vector<T> getColVector(int j) const;

  matrix transpose() const;
  // Requires a square matrix (assertion "rows == cols"); throws
  // MatrixException "Smatrix cast: result not a symmetric matrix" unless
  // every (i, j) equals (j, i) within a fuzz of 0.
  Smatrix<T> ConvertToSmatrix() const;

  // Same shape, asserted ("m_ == other.m_ && n_ == other.n_").
  matrix& operator+=(const matrix& other);
  matrix& operator-=(const matrix& other);
  matrix operator+(const matrix& other) const;
  matrix operator-(const matrix& other) const;
  matrix& operator*=(double k);

  // Eigenvalues ascending and eigenvectors as columns of a symmetric matrix
  // (lower triangle read); 0 or the index whose iteration failed.
  int EigenSystems(std::vector<T>& values, matrix& vectors) const;

 private:
  static constexpr std::uint32_t kSentinel = 0xfeedbaaau;
  void Grow(std::size_t size, const T& value);

  std::uint32_t sentinel_;
  int m_;
  int n_;
  int mn_;
  std::vector<T> v_;
};

// Symmetric, lower triangle packed by rows: (i, j) with i >= j at
// i(i+1)/2 + j; access exchanges i and j when i < j.
template <class T>
class Smatrix {
 public:
  Smatrix() : m_(0) {}
  explicit Smatrix(int order, const T& value = T()) : m_(0) { resize(order, value); }
  Smatrix(const Smatrix&) = default;
  Smatrix(Smatrix&&) noexcept = default;
  Smatrix& operator=(const Smatrix&) = default;
  Smatrix& operator=(Smatrix&&) noexcept = default;

  void resize(int order, const T& value = T()) {
    m_ = order < 0 ? 0 : order;
    v_.assign(calculate_size(m_), value);
  }
  static std::size_t calculate_size(int order) { return packedTriangleSize(order); }
  T& operator()(int i, int j) {
    return i >= j ? v_[packedIndexLower(i, j)] : v_[packedIndexLower(j, i)];
  }
  const T& operator()(int i, int j) const {
    return i >= j ? v_[packedIndexLower(i, j)] : v_[packedIndexLower(j, i)];
  }
  int size() const { return m_; }
  int rowCount() const { return m_; }
  int colCount() const { return m_; }
  std::vector<T>& storage() { return v_; }
  const std::vector<T>& storage() const { return v_; }
  std::vector<T> getRowVector(int i) const;
  std::vector<T> getColVector(int j) const { return getRowVector(j); }

 private:
  int m_;
  std::vector<T> v_;
};

// Upper triangular, packed by rows: (i, j) with i <= j at i m - i(i+1)/2 + j.
// Reads below the diagonal give 0 through a zero slot; a write there goes to
// a second slot that the next non-const access clears.
template <class T>
class UTmatrix {
 public:
  UTmatrix() : m_(0), constZero_(T()), zero_(T()) {}
  explicit UTmatrix(int order, const T& value = T()) : m_(0), constZero_(T()), zero_(T()) {
    resize(order, value);
  }
  UTmatrix(const UTmatrix&) = default;
  UTmatrix(UTmatrix&&) noexcept = default;
  UTmatrix& operator=(const UTmatrix&) = default;
  UTmatrix& operator=(UTmatrix&&) noexcept = default;

  void resize(int order, const T& value = T()) {
    m_ = order < 0 ? 0 : order;
    v_.assign(calculate_size(m_), value);
  }
  static std::size_t calculate_size(int order) { return packedTriangleSize(order); }
  T& operator()(int i, int j) {
    if (i > j) {
      zero_ = T();
      return zero_;
    }
    return v_[packedIndexUpper(i, j, m_)];
  }
  const T& operator()(int i, int j) const {
    return i > j ? constZero_ : v_[packedIndexUpper(i, j, m_)];
  }
  int size() const { return m_; }
  int rowCount() const { return m_; }
  int colCount() const { return m_; }
  std::vector<T>& storage() { return v_; }
  const std::vector<T>& storage() const { return v_; }

 private:
  int m_;
  std::vector<T> v_;
  T constZero_;
  T zero_;
};

// Diagonal: (i, i) is v_[i]; reads off the diagonal give 0 through the zero
// slots, as for UTmatrix.
template <class T>
class Dmatrix {
 public:
  Dmatrix() : constZero_(T()), m_(0), zero_(T()) {}
  explicit Dmatrix(int order, const T& value = T()) : constZero_(T()), m_(0), zero_(T()) {
    resize(order, value);
  }
  Dmatrix(const Dmatrix&) = default;
  Dmatrix(Dmatrix&&) noexcept = default;
  Dmatrix& operator=(const Dmatrix&) = default;
  Dmatrix& operator=(Dmatrix&&) noexcept = default;

  void resize(int order, const T& value = T()) {
    m_ = order < 0 ? 0 : order;
    v_.assign(calculate_size(m_), value);
  }
  static std::size_t calculate_size(int order) {
    return order <= 0 ? 0 : static_cast<std::size_t>(order);
  }
  T& operator()(int i, int j) {
    if (i != j) {
      zero_ = T();
      return zero_;
    }
    return v_[static_cast<std::size_t>(i)];
  }
  const T& operator()(int i, int j) const {
    return i != j ? constZero_ : v_[static_cast<std::size_t>(i)];
  }
  int size() const { return m_; }
  int rowCount() const { return m_; }
  int colCount() const { return m_; }
  std::vector<T>& storage() { return v_; }
  const std::vector<T>& storage() const { return v_; }

 private:
  T constZero_;
  int m_;
  std::vector<T> v_;
  T zero_;
};

// The upper triangle of a symmetric matrix, and back.
UTmatrix<double> SmatrixToUTmatrix(const Smatrix<double>& s);
Smatrix<double> mUTmatrixToSmatrix(const UTmatrix<double>& u);

extern template class matrix<double>;
extern template class Smatrix<double>;
extern template class UTmatrix<double>;
extern template class Dmatrix<double>;

}  // namespace matrix_library
}  // namespace qel

#endif
