// LU factorisation of a square matrix by Crout's method with implicit row
// scaling and partial pivoting, and what it gives: determinant, solutions,
// inverse.
//
// Singularity is absolute: a row whose largest magnitude, or a pivot, lies
// within mEqualWithinFuzz(0, value, 1) of 0 (about 1e-14) makes the matrix
// singular. Singular results are false with an emptied output; the
// ...WithThrow forms raise MatrixSingular.
#ifndef QEL_SRC_UTILITIES_MATRIXLIBRARY_MATRIX_LUDECOMPOSITION_H
#define QEL_SRC_UTILITIES_MATRIXLIBRARY_MATRIX_LUDECOMPOSITION_H

#include <vector>

#include "utilities/MatrixLibrary/matrix_impl.h"

namespace qel {
namespace matrix_library {

// In place on a: the unit lower factor below the diagonal and the upper one
// on and above it, rows exchanged as they were pivoted (*row_perm[j] is the
// row exchanged with j at step j). Non-square: MatrixException "LU Decomp is
// defined for only square matrices". Singular: a becomes 0 by 0, false.
bool LUDecompSafeIterator(matrix<double>& a, std::vector<int>* row_perm, double* parity);
// The same on a copy of a into *lu.
bool LUDecompTemplate(const matrix<double>& a, matrix<double>* lu, std::vector<int>* row_perm,
                      double* parity);

class LUDecomposition {
 public:
  explicit LUDecomposition(const matrix<double>& a);

  bool singular() const { return singular_; }
  const matrix<double>& factors() const { return lu_; }
  const std::vector<int>& permutation() const { return perm_; }
  double parity() const { return parity_; }

  // Parity times the product of the pivots; false and 0 when singular.
  bool Determinant(double* result) const;
  double DeterminantWithThrow() const;
  // A x = b. A length other than the order throws MatrixException "LU solve:
  // matrix and vector have incompatible dimensions".
  bool Solve(const std::vector<double>& b, std::vector<double>* x) const;
  // A X = B column by column; B and *X must be different objects.
  bool Solve(const matrix<double>& B, matrix<double>* X) const;
  bool Inverse(matrix<double>* result) const;

 private:
  void backSubstitute(std::vector<double>& x) const;

  matrix<double> lu_;
  bool singular_;
  std::vector<int> perm_;
  double parity_;
};

}  // namespace matrix_library
}  // namespace qel

#endif
