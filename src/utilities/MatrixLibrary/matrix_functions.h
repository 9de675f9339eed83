// Free functions over the value matrices: the operator table, products,
// quadratic forms, column helpers, printing, and the symmetric
// factorisations (Cholesky, inverse, eigensystem).
//
// Results of element-wise operations keep the narrowest kind that holds them:
// Smatrix with Smatrix or Dmatrix gives Smatrix, UTmatrix with UTmatrix or
// Dmatrix gives UTmatrix, Dmatrix with Dmatrix gives Dmatrix, and anything
// mixed with a general matrix gives a matrix. Shape errors throw
// MatrixException with the words named at each group.
#ifndef QEL_SRC_UTILITIES_MATRIXLIBRARY_MATRIX_FUNCTIONS_H
#define QEL_SRC_UTILITIES_MATRIXLIBRARY_MATRIX_FUNCTIONS_H

#include <ostream>
#include <vector>

#include "utilities/MatrixLibrary/matrix_impl.h"

namespace qel {
namespace matrix_library {

using Vec = std::vector<double>;
using Mat = matrix<double>;
using SMat = Smatrix<double>;
using UMat = UTmatrix<double>;
using DMat = Dmatrix<double>;

// ---- element-wise sums and differences ("matrix addition") -----------------
Mat operator+(const Mat& a, const DMat& b);
Mat operator+(const DMat& a, const Mat& b);
Mat operator+(const Mat& a, const SMat& b);
Mat operator+(const SMat& a, const Mat& b);
Mat operator+(const Mat& a, const UMat& b);
Mat operator+(const UMat& a, const Mat& b);
Mat operator+(const SMat& a, const UMat& b);
Mat operator+(const UMat& a, const SMat& b);
Mat operator-(const Mat& a, const DMat& b);
Mat operator-(const DMat& a, const Mat& b);
Mat operator-(const Mat& a, const SMat& b);
Mat operator-(const SMat& a, const Mat& b);
Mat operator-(const Mat& a, const UMat& b);
Mat operator-(const UMat& a, const Mat& b);
Mat operator-(const SMat& a, const UMat& b);
Mat operator-(const UMat& a, const SMat& b);
SMat operator+(const DMat& a, const SMat& b);
SMat operator+(const SMat& a, const DMat& b);
SMat operator+(const SMat& a, const SMat& b);
SMat operator-(const DMat& a, const SMat& b);
SMat operator-(const SMat& a, const DMat& b);
SMat operator-(const SMat& a, const SMat& b);
// "upper matrix element wise op"
UMat operator+(const DMat& a, const UMat& b);
UMat operator+(const UMat& a, const DMat& b);
UMat operator+(const UMat& a, const UMat& b);
UMat operator-(const DMat& a, const UMat& b);
UMat operator-(const UMat& a, const DMat& b);
UMat operator-(const UMat& a, const UMat& b);
// "diagonal matrix elementwise op"
DMat operator+(const DMat& a, const DMat& b);
DMat operator-(const DMat& a, const DMat& b);
// "matrix += diagonal"
Mat& operator+=(Mat& a, const DMat& b);

// ---- scalar products ---------------------------------------------------------
Mat operator*(double k, const Mat& a);
Mat operator*(const Mat& a, double k);
SMat operator*(double k, const SMat& a);
SMat operator*(const SMat& a, double k);
UMat operator*(double k, const UMat& a);
UMat operator*(const UMat& a, double k);
DMat operator*(double k, const DMat& a);
DMat operator*(const DMat& a, double k);

// ---- matrix products ("Matrix multiplication: incompatible orders") --------
// Full products run in tiles of 8 by 8 by 8.
Mat operator*(const Mat& a, const Mat& b);
Mat operator*(const Mat& a, const SMat& b);
Mat operator*(const Mat& a, const UMat& b);
Mat operator*(const Mat& a, const DMat& b);
Mat operator*(const SMat& a, const Mat& b);
Mat operator*(const SMat& a, const SMat& b);
Mat operator*(const SMat& a, const UMat& b);
Mat operator*(const SMat& a, const DMat& b);
Mat operator*(const UMat& a, const Mat& b);
Mat operator*(const UMat& a, const SMat& b);
UMat operator*(const UMat& a, const UMat& b);
UMat operator*(const UMat& a, const DMat& b);
Mat operator*(const DMat& a, const Mat& b);
Mat operator*(const DMat& a, const SMat& b);
UMat operator*(const DMat& a, const UMat& b);
DMat operator*(const DMat& a, const DMat& b);
Mat& operator*=(Mat& a, const Mat& b);
DMat& operator*=(DMat& a, const DMat& b);
// The plain triple loop (i, j, k) with a local sum.
Mat SlowMatrixMultiply(const Mat& a, const Mat& b);
// c = a' b and c = a b'; no dimension check (the caller's shapes must agree).
void multiplyLeftTranspose(const Mat& a, const Mat& b, Mat& c);
void multiplyRightTranspose(const Mat& a, const Mat& b, Mat& c);

// ---- with a vector -------------------------------------------------------------
// The matrix must be one column of the vector's length: "op+= matrix and
// vector must be of same order" ("op-= ..." for the differences).
Mat& operator+=(Mat& a, const Vec& x);
Mat& operator-=(Mat& a, const Vec& x);
Mat operator+(const Mat& a, const Vec& x);
Mat operator-(const Mat& a, const Vec& x);
// One-column product: "matrix and vector must be of same order".
Mat operator*(const Mat& a, const Vec& x);
Mat operator*(const SMat& a, const Vec& x);

// ---- quadratic forms -------------------------------------------------------------
// x' A x. Non-square A: "matrix::quadratic form is only defined for square
// matrices"; a length mismatch: "matrix::matrix and vector have incompatible
// dimensions".
double mQuadraticForm(const Mat& a, const Vec& x);
double mQuadraticForm(const SMat& a, const Vec& x);
// (X x)' A (X y): the form of A in the images of x and y under X, with A
// square of X's row count and x, y of X's column count.
double mQuadraticForm(const Mat& a, const Mat& X, const Vec& x, const Vec& y);
double mQuadraticForm(const SMat& a, const Mat& X, const Vec& x, const Vec& y);

// ---- flattening, column helpers, printing ----------------------------------
// Writes the elements into out from offset, growing out when it is short,
// and returns the offset after the last one. A matrix goes row by row when
// byRow is true, column by column otherwise. An Smatrix writes its stored
// triangle only: the lower triangle row by row (byRow) or column by column.
int mFlattenmatrix(const Mat& a, Vec& out, int offset, bool byRow);
int mFlattenmatrix(const SMat& a, Vec& out, int offset, bool byRow);
// Sums over k below count of a(k, i) a(k, j), and of a(k, i) x[k]. count
// above the rows (or the vector): "matrix::number of products greater than
// dimension"; count below 1 gives 0.
double DotProduct(const Mat& a, int i, int j, int count);
double DotProduct(const Mat& a, int i, const Vec& x, int count);
// a(k, column) *= factor; a(k, target) += factor a(k, source); a(k, target)
// += factor x[k]; each for k below count, with the count check above.
void KTimesColumn(Mat& a, int column, double factor, int count);
void KTimesColumnPlusColumn(Mat& a, int target, double factor, int source, int count);
void KTimesColumnPlusVector(Mat& a, int target, double factor, const Vec& x, int count);
// "[a, b, c]"
std::ostream& operator<<(std::ostream& out, const Vec& x);
// "<Value: x>" for a value; a matrix one row a line in the vector form.
void show(std::ostream& out, double value);
void show(std::ostream& out, const Mat& a);

// ---- symmetric factorisations ------------------------------------------------
// Upper triangular U with U'U = A; false (and *result emptied) unless A is
// positive definite.
bool CholeskyDecomp(const SMat& a, UMat* result);
// The row form resumed at column start on the upper triangle u (rows before
// start of every column taken as already factored). *failedRow is -1 on
// success, else the column whose pivot was not positive, with *residual the
// magnitude of that pivot. start above the order: "UTmatrix: starting row
// greater than dimension".
UMat CholeskyDecomp(const UMat& u, int start, int* failedRow, double* residual);
// Throws MatrixSingular unless positive definite.
UMat CholeskyDecompWithThrow(const SMat& a);
// (U'U)^{-1} from the factor U.
SMat CholeskyInverse(const UMat& u);
// Solves U'U x = b. Length mismatch: "UTmatrix: matrix and vector have
// incompatible dimensions".
Vec CholeskyBackSub(const UMat& u, const Vec& b);

// Householder tridiagonalisation and the QL iteration with implicit shifts
// (EISPACK tred2 and tql2). Reads the lower triangle; values ascending,
// vectors as columns. Returns 0, or the index whose eigenvalue did not
// converge in 30 iterations (values then unsorted).
int EigenSystems(const Mat& a, Vec& values, Mat& vectors);

// ---- inverse and determinant of the square kinds -----------------------------
// false (result emptied) when singular; the ...WithThrow forms raise
// MatrixSingular. An Smatrix is inverted through its Cholesky factor: one
// that is not positive definite counts as singular.
bool inverse(const Mat& a, Mat* result);
bool inverse(const SMat& a, SMat* result);
bool inverse(const DMat& a, DMat* result);
Mat inverseWithThrow(const Mat& a);
SMat inverseWithThrow(const SMat& a);
DMat inverseWithThrow(const DMat& a);
bool determinant(const Mat& a, double* result);
bool determinant(const SMat& a, double* result);
double determinantWithThrow(const Mat& a);
double determinantWithThrow(const SMat& a);

}  // namespace matrix_library
}  // namespace qel

#endif
