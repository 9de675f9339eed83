// Immutable expression trees over the value matrices, for long products and
// sums where a factor may be applied to a vector or a thin matrix without
// forming the whole product. Trees share subtrees freely: nodes never change
// after construction. Shape errors appear at evaluation, from the matrix
// operations, not at construction.
#ifndef QEL_SRC_UTILITIES_MATRIXLIBRARY_MATRIX_EXPRESSION_H
#define QEL_SRC_UTILITIES_MATRIXLIBRARY_MATRIX_EXPRESSION_H

#include <memory>
#include <ostream>

#include "utilities/MatrixLibrary/matrix_impl.h"

namespace qel {
namespace matrix_library {
namespace expressions {

class ExpressionNode {
 public:
  ExpressionNode(int rows, int cols) : M(rows), N(cols) {}
  virtual ~ExpressionNode();
  // This times x, and x times this.
  virtual matrix<double> MultiplyOnRight(const matrix<double>& x) const = 0;
  virtual matrix<double> MultiplyOnLeft(const matrix<double>& x) const = 0;
  virtual matrix<double> Evaluate() const = 0;
  virtual void ToString(std::ostream& out, int depth) const = 0;

  const int M;
  const int N;
};

using Tree = std::shared_ptr<const ExpressionNode>;

Tree M_(const matrix<double>& a);
Tree M_(const Smatrix<double>& a);
Tree M_(const Dmatrix<double>& a);
Tree M_(const UTmatrix<double>& a);
Tree Mult(const Tree& a, const Tree& b);
Tree Add(const Tree& a, const Tree& b);
Tree Sub(const Tree& a, const Tree& b);
Tree Transpose(const Tree& a);
// The operand with that row (column) set to 0.
Tree ZeroRow(const Tree& a, int row);
Tree ZeroColumn(const Tree& a, int column);
Tree operator*(const Tree& a, const Tree& b);
Tree operator+(const Tree& a, const Tree& b);
Tree operator-(const Tree& a, const Tree& b);

matrix<double> Evaluate(const Tree& tree);
int RowCount(const Tree& tree);
int ColumnCount(const Tree& tree);
// Row i (a 1 by N matrix) and column j (M by 1), through MultiplyOnLeft and
// MultiplyOnRight with a unit vector; out of range fails the assertions
// "row >= 0 && row < M" and "column >= 0 && column < N".
matrix<double> GetRow(const Tree& tree, int row);
matrix<double> GetColumn(const Tree& tree, int column);
matrix<double> MultiplyOnLeft(const matrix<double>& x, const Tree& tree);
matrix<double> MultiplyOnRight(const Tree& tree, const matrix<double>& x);
std::ostream& operator<<(std::ostream& out, const Tree& tree);

// Set one row (column) of m to 0; asserted in range.
void ClearRow(matrix<double>& m, int row);
void ClearColumn(matrix<double>& m, int column);

}  // namespace expressions
}  // namespace matrix_library
}  // namespace qel

#endif
