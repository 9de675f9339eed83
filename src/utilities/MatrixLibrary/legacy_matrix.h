// The older polymorphic matrices: a general row-major matrix and two packed
// square layouts (symmetric, upper triangular) that reach their elements
// through virtual access, so that one generic algorithm (transpose, products,
// dot products of columns, the row form of the Cholesky factorisation) serves
// all three. Their one user is the multivariate normal distribution, which
// factors its covariance with Smatrix::CholeskyDecomp and applies the factor
// with transpose, operator*, operator+ and the vector conversion.
//
// Failures are std::domain_error with fixed words (see each operation).
// Element access has no range test. Row and column indices passed to the
// editing operations (delRow, removeRow, insertRow and their column forms)
// that name no row or column leave the matrix as it is.
#ifndef QEL_SRC_UTILITIES_MATRIXLIBRARY_LEGACY_MATRIX_H
#define QEL_SRC_UTILITIES_MATRIXLIBRARY_LEGACY_MATRIX_H

#include <cstddef>
#include <vector>

namespace qel {

template <class T>
class UTmatrix;

template <class T>
class matrix {
 public:
  // 0 by 0.
  matrix();
  // rows by cols, every element value. Negative dimensions count as 0.
  matrix(int rows, int cols, const T& value = T());
  // Copies element by element through the other's access, so that a packed
  // matrix copies into its full form.
  matrix(const matrix& other);
  virtual ~matrix();

  virtual T& operator()(int i, int j);
  virtual const T& operator()(int i, int j) const;
  // A new matrix without row i (column j).
  virtual matrix delRow(int i) const;
  virtual matrix delCol(int j) const;
  // The same in place, by erasing from the storage.
  virtual matrix& removeRow(int i);
  virtual matrix& removeCol(int j);
  // Insert before row i (column j), i from 0 to the number of rows; a row of
  // one value or a given row, which must have as many elements as there are
  // columns (std::domain_error "addRow\trow vector must be of same order",
  // "addCol column vector must be of same order").
  virtual matrix& insertRow(int i, const T& value);
  virtual matrix& insertRow(int i, const std::vector<T>& row);
  virtual matrix& insertCol(int j, const T& value);
  virtual matrix& insertCol(int j, const std::vector<T>& column);

  int rowCount() const { return m_; }
  int colCount() const { return n_; }

  matrix transpose() const;
  // Same shape: copies element by element through access; otherwise the
  // storage is released and reallocated in the other's shape first.
  matrix& operator=(const matrix& other);
  // rows by cols of zeros.
  void initialize(int rows, int cols);

  // One-column product. Columns must equal the vector's length, else
  // std::domain_error "matrix and vector multiplication: incompatible orders".
  matrix operator*(const std::vector<T>& x) const;
  // One column of the vector's length, else std::domain_error
  // "op+= matrix and vector must be of same order".
  matrix& operator+=(const std::vector<T>& x);
  matrix operator+(const std::vector<T>& x) const;
  // One column only, else std::domain_error "vector cast: result not a vector".
  operator std::vector<T>() const;

  // Sum over k below count of element (k, i) times element (k, j): the dot
  // product of the first count entries of columns i and j. count above the
  // rows: std::domain_error "matrix::number of products greater than
  // dimension"; count below 1: 0 without touching an element.
  T DotProduct(int i, int j, int count) const;

 protected:
  // For the packed layouts: order by order, stored elements held in v_.
  struct Packed {};
  matrix(Packed, int order, std::size_t stored, const T& value);
  void copyMatrix(const matrix& other);
  void destroy();
  // The editing operations work on row-major storage only.
  bool isRowMajor() const;

  int m_;
  int n_;
  int mn_;
  // Target of the reads below the diagonal of the triangular layout; cleared
  // at every such access, so a write there is lost.
  mutable T zero_;
  std::vector<T> v_;
};

// Symmetric, lower triangle packed by rows: (i, j) with i >= j at
// i(i+1)/2 + j; access exchanges i and j when i < j. Rows and columns cannot
// be removed or inserted: those operations do nothing and return the object.
template <class T>
class Smatrix : public matrix<T> {
 public:
  Smatrix();
  explicit Smatrix(int order, const T& value = T());
  // From order(order+1)/2 elements of the lower triangle packed by rows.
  Smatrix(int order, const T* packedLower);
  Smatrix(const Smatrix& other);
  Smatrix& operator=(const Smatrix& other);
  ~Smatrix() override;

  T& operator()(int i, int j) override;
  const T& operator()(int i, int j) const override;
  matrix<T>& removeRow(int i) override;
  matrix<T>& removeCol(int j) override;
  matrix<T>& insertRow(int i, const T& value) override;
  matrix<T>& insertRow(int i, const std::vector<T>& row) override;
  matrix<T>& insertCol(int j, const T& value) override;
  matrix<T>& insertCol(int j, const std::vector<T>& column) override;

  int order() const { return this->m_; }

  // Upper triangular U with U'U equal to this matrix (U' is the lower
  // Cholesky factor). Not positive definite, or an element that is not
  // finite: std::domain_error "Smatrix: matrix is not positive definite".
  UTmatrix<T> CholeskyDecomp() const;
};

// Upper triangular, upper triangle packed by rows: (i, j) with i <= j at
// i m - i(i+1)/2 + j. Reads below the diagonal give 0.
template <class T>
class UTmatrix : public matrix<T> {
 public:
  UTmatrix();
  explicit UTmatrix(int order, const T& value = T());
  UTmatrix(const UTmatrix& other);
  UTmatrix& operator=(const UTmatrix& other);
  ~UTmatrix() override;

  T& operator()(int i, int j) override;
  const T& operator()(int i, int j) const override;

  int order() const { return this->m_; }

  // Row form of the Cholesky factorisation of the symmetric matrix whose
  // upper triangle this is, resuming at column start: columns before start,
  // and the rows before start of the later columns, are taken as already
  // factored. For each column j from start, with a residual starting at 0:
  // for i below j, u(i,j) = (u(i,j) - dot of columns i and j over the first i
  // entries) / u(i,i) when i >= start, and the residual gains u(i,j)^2; then
  // d = u(j,j) - residual. d <= 0 stops with *failedRow = j and *residual =
  // |d|; otherwise u(j,j) = sqrt(d). Success leaves *failedRow = -1. Works on
  // a copy and returns it. start above the order: std::domain_error
  // "UTmatrix: starting row greater than dimension"; a negative start counts
  // as 0. Null out-pointers are allowed.
  UTmatrix CholeskyDecomp(int start, int* failedRow, T* residual) const;
};

// The upper triangle of a symmetric matrix.
template <class T>
UTmatrix<T> mSmatrixToUTmatrix(const Smatrix<T>& s);

extern template class matrix<double>;
extern template class Smatrix<double>;
extern template class UTmatrix<double>;
extern template UTmatrix<double> mSmatrixToUTmatrix(const Smatrix<double>&);

}  // namespace qel

#endif
