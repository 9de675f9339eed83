// Quadratic forms, flattening, column helpers and printing of the value
// matrices.
#include "utilities/MatrixLibrary/matrix_functions.h"

namespace qel {
namespace matrix_library {

namespace {

const char kNotSquare[] = "matrix::quadratic form is only defined for square matrices";
const char kIncompatible[] = "matrix::matrix and vector have incompatible dimensions";
const char kTooManyProducts[] = "matrix::number of products greater than dimension";

std::size_t at(int k) {
  return static_cast<std::size_t>(k);
}

template <class A>
double quadraticForm(const A& a, const Vec& x) {
  if (a.rowCount() != a.colCount()) throw MatrixException(kNotSquare);
  if (a.rowCount() != static_cast<int>(x.size())) throw MatrixException(kIncompatible);
  double sum = 0.0;
  for (int i = 0; i < a.rowCount(); ++i) {
    double row = 0.0;
    for (int j = 0; j < a.colCount(); ++j) row += a(i, j) * x[at(j)];
    sum += x[at(i)] * row;
  }
  return sum;
}

// X x as a vector.
Vec image(const Mat& X, const Vec& x) {
  Vec y(at(X.rowCount()), 0.0);
  for (int i = 0; i < X.rowCount(); ++i) {
    double sum = 0.0;
    for (int j = 0; j < X.colCount(); ++j) sum += X(i, j) * x[at(j)];
    y[at(i)] = sum;
  }
  return y;
}

template <class A>
double middleForm(const A& a, const Mat& X, const Vec& x, const Vec& y) {
  if (a.rowCount() != a.colCount()) throw MatrixException(kNotSquare);
  if (a.rowCount() != X.rowCount() || X.colCount() != static_cast<int>(x.size()) ||
      x.size() != y.size())
    throw MatrixException(kIncompatible);
  const Vec u = image(X, x);
  const Vec v = image(X, y);
  double sum = 0.0;
  for (int i = 0; i < a.rowCount(); ++i) {
    double row = 0.0;
    for (int j = 0; j < a.colCount(); ++j) row += a(i, j) * v[at(j)];
    sum += u[at(i)] * row;
  }
  return sum;
}

void checkCount(const Mat& a, int count) {
  if (count > a.rowCount()) throw MatrixException(kTooManyProducts);
}

void place(Vec& out, int& offset, double value) {
  if (offset < 0) offset = 0;
  if (at(offset) >= out.size()) out.resize(at(offset) + 1, 0.0);
  out[at(offset++)] = value;
}

}  // namespace

double mQuadraticForm(const Mat& a, const Vec& x) {
  return quadraticForm(a, x);
}
double mQuadraticForm(const SMat& a, const Vec& x) {
  return quadraticForm(a, x);
}
double mQuadraticForm(const Mat& a, const Mat& X, const Vec& x, const Vec& y) {
  return middleForm(a, X, x, y);
}
double mQuadraticForm(const SMat& a, const Mat& X, const Vec& x, const Vec& y) {
  return middleForm(a, X, x, y);
}

int mFlattenmatrix(const Mat& a, Vec& out, int offset, bool byRow) {
  if (byRow) {
    for (int i = 0; i < a.rowCount(); ++i) {
      for (int j = 0; j < a.colCount(); ++j) place(out, offset, a(i, j));
    }
  } else {
    for (int j = 0; j < a.colCount(); ++j) {
      for (int i = 0; i < a.rowCount(); ++i) place(out, offset, a(i, j));
    }
  }
  return offset;
}

int mFlattenmatrix(const SMat& a, Vec& out, int offset, bool byRow) {
  const int m = a.size();
  if (byRow) {
    for (int i = 0; i < m; ++i) {
      for (int j = 0; j <= i; ++j) place(out, offset, a(i, j));
    }
  } else {
    for (int j = 0; j < m; ++j) {
      for (int i = j; i < m; ++i) place(out, offset, a(i, j));
    }
  }
  return offset;
}

double DotProduct(const Mat& a, int i, int j, int count) {
  checkCount(a, count);
  double sum = 0.0;
  for (int k = 0; k < count; ++k) sum += a(k, i) * a(k, j);
  return sum;
}

double DotProduct(const Mat& a, int i, const Vec& x, int count) {
  checkCount(a, count);
  if (count > static_cast<int>(x.size())) throw MatrixException(kTooManyProducts);
  double sum = 0.0;
  for (int k = 0; k < count; ++k) sum += a(k, i) * x[at(k)];
  return sum;
}

void KTimesColumn(Mat& a, int column, double factor, int count) {
  checkCount(a, count);
  for (int k = 0; k < count; ++k) a(k, column) *= factor;
}

void KTimesColumnPlusColumn(Mat& a, int target, double factor, int source, int count) {
  checkCount(a, count);
  for (int k = 0; k < count; ++k) a(k, target) += factor * a(k, source);
}

void KTimesColumnPlusVector(Mat& a, int target, double factor, const Vec& x, int count) {
  checkCount(a, count);
  if (count > static_cast<int>(x.size())) throw MatrixException(kTooManyProducts);
  for (int k = 0; k < count; ++k) a(k, target) += factor * x[at(k)];
}

std::ostream& operator<<(std::ostream& out, const Vec& x) {
  out << "[";
  for (std::size_t k = 0; k < x.size(); ++k) out << (k == 0 ? "" : ", ") << x[k];
  return out << "]";
}

void show(std::ostream& out, double value) {
  out << "<Value: " << value << ">";
}

void show(std::ostream& out, const Mat& a) {
  for (int i = 0; i < a.rowCount(); ++i) out << a.getRowVector(i) << "\n";
}

}  // namespace matrix_library
}  // namespace qel
