// The nodes of the expression trees and the operations over them.
#include "utilities/MatrixLibrary/matrix_expression.h"

#include <utility>

#include "utilities/MatrixLibrary/matrix_functions.h"

namespace qel {
namespace matrix_library {
namespace expressions {

ExpressionNode::~ExpressionNode() {}

namespace {

using Mat = matrix<double>;

class MultNode : public ExpressionNode {
 public:
  MultNode(Tree left, Tree right)
      : ExpressionNode(left->M, right->N), left_(std::move(left)), right_(std::move(right)) {}
  Mat MultiplyOnRight(const Mat& x) const override {
    return left_->MultiplyOnRight(right_->MultiplyOnRight(x));
  }
  Mat MultiplyOnLeft(const Mat& x) const override {
    return right_->MultiplyOnLeft(left_->MultiplyOnLeft(x));
  }
  Mat Evaluate() const override {
    const Mat left = left_->Evaluate();
    const Mat right = right_->Evaluate();
    return left * right;
  }
  void ToString(std::ostream& out, int depth) const override {
    out << "( ";
    left_->ToString(out, depth + 1);
    out << " * ";
    right_->ToString(out, depth + 1);
    out << ")";
  }

 private:
  Tree left_;
  Tree right_;
};

// AddNode (kAdd true) and SubNode.
template <bool kAdd>
class SumNode : public ExpressionNode {
 public:
  SumNode(Tree left, Tree right)
      : ExpressionNode(left->M, left->N), left_(std::move(left)), right_(std::move(right)) {}
  Mat MultiplyOnRight(const Mat& x) const override {
    return combine(left_->MultiplyOnRight(x), right_->MultiplyOnRight(x));
  }
  Mat MultiplyOnLeft(const Mat& x) const override {
    return combine(left_->MultiplyOnLeft(x), right_->MultiplyOnLeft(x));
  }
  Mat Evaluate() const override { return combine(left_->Evaluate(), right_->Evaluate()); }
  void ToString(std::ostream& out, int depth) const override {
    out << "( ";
    left_->ToString(out, depth + 1);
    out << (kAdd ? " + " : " - ");
    right_->ToString(out, depth + 1);
    out << ")";
  }

 private:
  Mat combine(Mat left, const Mat& right) const {
    if (kAdd) return left += right;
    return left -= right;
  }

  Tree left_;
  Tree right_;
};
using AddNode = SumNode<true>;
using SubNode = SumNode<false>;

class TransposeNode : public ExpressionNode {
 public:
  explicit TransposeNode(Tree operand)
      : ExpressionNode(operand->N, operand->M), operand_(std::move(operand)) {}
  Mat MultiplyOnRight(const Mat& x) const override {
    return operand_->MultiplyOnLeft(x.transpose()).transpose();
  }
  Mat MultiplyOnLeft(const Mat& x) const override {
    return operand_->MultiplyOnRight(x.transpose()).transpose();
  }
  Mat Evaluate() const override { return operand_->Evaluate().transpose(); }
  void ToString(std::ostream& out, int depth) const override {
    out << "( ";
    operand_->ToString(out, depth + 1);
    out << " transpose ) ";
  }

 private:
  Tree operand_;
};

class ZeroRowNode : public ExpressionNode {
 public:
  ZeroRowNode(Tree operand, int row)
      : ExpressionNode(operand->M, operand->N), operand_(std::move(operand)), row_(row) {}
  Mat MultiplyOnRight(const Mat& x) const override {
    Mat y = operand_->MultiplyOnRight(x);
    ClearRow(y, row_);
    return y;
  }
  Mat MultiplyOnLeft(const Mat& x) const override {
    Mat y(x);
    ClearColumn(y, row_);
    return operand_->MultiplyOnLeft(y);
  }
  Mat Evaluate() const override {
    Mat y = operand_->Evaluate();
    ClearRow(y, row_);
    return y;
  }
  void ToString(std::ostream& out, int depth) const override {
    out << "(zero row : " << row_ << " ";
    operand_->ToString(out, depth + 1);
    out << ")";
  }

 private:
  Tree operand_;
  int row_;
};

class ZeroColumnNode : public ExpressionNode {
 public:
  ZeroColumnNode(Tree operand, int column)
      : ExpressionNode(operand->M, operand->N), operand_(std::move(operand)), column_(column) {}
  Mat MultiplyOnRight(const Mat& x) const override {
    Mat y(x);
    ClearRow(y, column_);
    return operand_->MultiplyOnRight(y);
  }
  Mat MultiplyOnLeft(const Mat& x) const override {
    Mat y = operand_->MultiplyOnLeft(x);
    ClearColumn(y, column_);
    return y;
  }
  Mat Evaluate() const override {
    Mat y = operand_->Evaluate();
    ClearColumn(y, column_);
    return y;
  }
  void ToString(std::ostream& out, int depth) const override {
    out << "(zero column : " << column_ << " ";
    operand_->ToString(out, depth + 1);
    out << ")";
  }

 private:
  Tree operand_;
  int column_;
};

template <class T>
class ValueNode : public ExpressionNode {
 public:
  explicit ValueNode(const T& value)
      : ExpressionNode(value.rowCount(), value.colCount()), value_(value) {}
  Mat MultiplyOnRight(const Mat& x) const override { return value_ * x; }
  Mat MultiplyOnLeft(const Mat& x) const override { return x * value_; }
  Mat Evaluate() const override { return Mat(value_); }
  void ToString(std::ostream& out, int) const override {
    out << "< Matrix " << M << " by " << N << ">";
  }

 private:
  T value_;
};

template <class T>
Tree ToTree(const T& value) {
  return std::make_shared<const ValueNode<T>>(value);
}

}  // namespace

Tree M_(const matrix<double>& a) {
  return ToTree(a);
}
Tree M_(const Smatrix<double>& a) {
  return ToTree(a);
}
Tree M_(const Dmatrix<double>& a) {
  return ToTree(a);
}
Tree M_(const UTmatrix<double>& a) {
  return ToTree(a);
}
Tree Mult(const Tree& a, const Tree& b) {
  return std::make_shared<const MultNode>(a, b);
}
Tree Add(const Tree& a, const Tree& b) {
  return std::make_shared<const AddNode>(a, b);
}
Tree Sub(const Tree& a, const Tree& b) {
  return std::make_shared<const SubNode>(a, b);
}
Tree Transpose(const Tree& a) {
  return std::make_shared<const TransposeNode>(a);
}
Tree ZeroRow(const Tree& a, int row) {
  return std::make_shared<const ZeroRowNode>(a, row);
}
Tree ZeroColumn(const Tree& a, int column) {
  return std::make_shared<const ZeroColumnNode>(a, column);
}
Tree operator*(const Tree& a, const Tree& b) {
  return Mult(a, b);
}
Tree operator+(const Tree& a, const Tree& b) {
  return Add(a, b);
}
Tree operator-(const Tree& a, const Tree& b) {
  return Sub(a, b);
}

matrix<double> Evaluate(const Tree& tree) {
  return tree->Evaluate();
}
int RowCount(const Tree& tree) {
  return tree->M;
}
int ColumnCount(const Tree& tree) {
  return tree->N;
}

matrix<double> GetRow(const Tree& tree, int row) {
  const int M = tree->M;
  QEL_ALLEGE(row >= 0 && row < M);
  matrix<double> unit(1, M, 0.0);
  unit(0, row) = 1.0;
  return tree->MultiplyOnLeft(unit);
}

matrix<double> GetColumn(const Tree& tree, int column) {
  const int N = tree->N;
  QEL_ALLEGE(column >= 0 && column < N);
  matrix<double> unit(N, 1, 0.0);
  unit(column, 0) = 1.0;
  return tree->MultiplyOnRight(unit);
}

matrix<double> MultiplyOnLeft(const matrix<double>& x, const Tree& tree) {
  return tree->MultiplyOnLeft(x);
}
matrix<double> MultiplyOnRight(const Tree& tree, const matrix<double>& x) {
  return tree->MultiplyOnRight(x);
}

std::ostream& operator<<(std::ostream& out, const Tree& tree) {
  tree->ToString(out, 0);
  return out;
}

void ClearRow(matrix<double>& m, int row) {
  QEL_ALLEGE(row >= 0 && row < m.rowCount());
  for (int j = 0; j < m.colCount(); ++j) m(row, j) = 0.0;
}

void ClearColumn(matrix<double>& m, int column) {
  QEL_ALLEGE(column >= 0 && column < m.colCount());
  for (int i = 0; i < m.rowCount(); ++i) m(i, column) = 0.0;
}

}  // namespace expressions
}  // namespace matrix_library
}  // namespace qel
