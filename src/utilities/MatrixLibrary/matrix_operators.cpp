// The operator table of the value matrices: element-wise sums and
// differences, scalar products, and the products of every pair of kinds.
#include <algorithm>

#include "utilities/MatrixLibrary/matrix_functions.h"
#include "utilities/MatrixLibrary/simd_pair.h"

namespace qel {
namespace matrix_library {

namespace {

const char kAddition[] = "matrix addition";
const char kUpper[] = "upper matrix element wise op";
const char kDiagonal[] = "diagonal matrix elementwise op";

// result(i, j) = a(i, j) + sign b(i, j) over every element of a full result.
template <class A, class B>
Mat elementwiseFull(const A& a, const B& b, double sign) {
  checkEqualDimensions(kAddition, a.rowCount(), a.colCount(), b.rowCount(), b.colCount());
  Mat c(a.rowCount(), a.colCount(), 0.0);
  for (int i = 0; i < c.rowCount(); ++i) {
    for (int j = 0; j < c.colCount(); ++j) c(i, j) = a(i, j) + sign * b(i, j);
  }
  return c;
}

// The same over the stored triangle of a packed result (lower for Smatrix,
// upper for UTmatrix); Dmatrix results keep the diagonal.
template <class R, class A, class B>
R elementwisePacked(const char* label, const A& a, const B& b, double sign, bool lower) {
  checkEqualDimensions(label, a.rowCount(), a.colCount(), b.rowCount(), b.colCount());
  R c(a.rowCount());
  const int m = c.size();
  for (int i = 0; i < m; ++i) {
    const int first = lower ? 0 : i;
    const int last = lower ? i : m - 1;
    for (int j = first; j <= last; ++j) c(i, j) = a(i, j) + sign * b(i, j);
  }
  return c;
}

DMat elementwiseDiagonal(const DMat& a, const DMat& b, double sign) {
  checkEqualDimensions(kDiagonal, a.size(), a.size(), b.size(), b.size());
  DMat c(a.size());
  for (int i = 0; i < a.size(); ++i) c(i, i) = a(i, i) + sign * b(i, i);
  return c;
}

// Scalar product over the stored elements of a packed kind.
template <class P>
P UpperUnaryOp(const P& a, double k) {
  P c(a);
  for (double& x : c.storage()) x *= k;
  return c;
}

// c += a(i0:i1, k0:k1) b(k0:k1, j0:j1) through element access.
template <class A, class B>
void multiplyHelper(int i0, int i1, int k0, int k1, int j0, int j1, const A& a, const B& b,
                    Mat& c) {
  for (int i = i0; i < i1; ++i) {
    for (int k = k0; k < k1; ++k) {
      const double aik = a(i, k);
      for (int j = j0; j < j1; ++j) c(i, j) += aik * b(k, j);
    }
  }
}

// Two full matrices: the same tile on the row-major arrays, a full tile row
// of c held in four register pairs while the inner index runs.
void multiplyHelper(int i0, int i1, int k0, int k1, int j0, int j1, const Mat& a, const Mat& b,
                    Mat& c) {
  using simd::broadcast;
  using simd::load;
  using simd::Pair;
  using simd::store;
  const int n = b.colCount();
  const int inner = a.colCount();
  const double* bv = b.data();
  for (int i = i0; i < i1; ++i) {
    double* crow = c.data() + static_cast<std::size_t>(i) * n;
    const double* arow = a.data() + static_cast<std::size_t>(i) * inner;
    if (j1 - j0 == 8) {
      Pair c0 = load(crow + j0), c1 = load(crow + j0 + 2), c2 = load(crow + j0 + 4),
           c3 = load(crow + j0 + 6);
      for (int k = k0; k < k1; ++k) {
        const Pair aik = broadcast(arow[k]);
        const double* brow = bv + static_cast<std::size_t>(k) * n + j0;
        c0 += aik * load(brow);
        c1 += aik * load(brow + 2);
        c2 += aik * load(brow + 4);
        c3 += aik * load(brow + 6);
      }
      store(crow + j0, c0);
      store(crow + j0 + 2, c1);
      store(crow + j0 + 4, c2);
      store(crow + j0 + 6, c3);
      continue;
    }
    for (int k = k0; k < k1; ++k) {
      const double aik = arow[k];
      const double* brow = bv + static_cast<std::size_t>(k) * n;
      for (int j = j0; j < j1; ++j) crow[j] += aik * brow[j];
    }
  }
}

constexpr int kTile = 8;

// Zeroed result, tiles of 8 by 8 by 8 in the order rows, columns, inner.
template <class A, class B>
Mat fullMultiplyTemplate(const A& a, const B& b) {
  checkMultiplyDimensions(a.colCount(), b.rowCount());
  const int m = a.rowCount();
  const int n = b.colCount();
  const int inner = a.colCount();
  Mat c(m, n, 0.0);
  for (int i0 = 0; i0 < m; i0 += kTile) {
    const int i1 = std::min(m, i0 + kTile);
    for (int j0 = 0; j0 < n; j0 += kTile) {
      const int j1 = std::min(n, j0 + kTile);
      for (int k0 = 0; k0 < inner; k0 += kTile) {
        multiplyHelper(i0, i1, k0, std::min(inner, k0 + kTile), j0, j1, a, b, c);
      }
    }
  }
  return c;
}

// A diagonal factor scales the rows (diagonal on the left) or the columns
// (on the right) of the other operand.
template <class R, class A>
R DiagonalMultiplyTemplate(const DMat& d, const A& a, bool diagonalOnLeft) {
  if (diagonalOnLeft) {
    checkMultiplyDimensions(d.colCount(), a.rowCount());
  } else {
    checkMultiplyDimensions(a.colCount(), d.rowCount());
  }
  R c(a);
  for (int i = 0; i < a.rowCount(); ++i) {
    for (int j = 0; j < a.colCount(); ++j) {
      c(i, j) = a(i, j) * (diagonalOnLeft ? d(i, i) : d(j, j));
    }
  }
  return c;
}

// Upper triangular product: (i, j) sums over k from i to j only.
UMat SquareMultiplyTemplate(const UMat& a, const UMat& b) {
  checkMultiplyDimensions(a.colCount(), b.rowCount());
  const int M = a.size();
  const int N = b.size();
  QEL_ALLEGE(M == N);
  UMat c(M);
  for (int i = 0; i < M; ++i) {
    for (int j = i; j < N; ++j) {
      double sum = 0.0;
      for (int k = i; k <= j; ++k) sum += a(i, k) * b(k, j);
      c(i, j) = sum;
    }
  }
  return c;
}

void checkColumnOfVector(const Mat& a, const Vec& x, const char* words) {
  if (a.colCount() != 1 || a.rowCount() != static_cast<int>(x.size())) throw MatrixException(words);
}

template <class A>
Mat timesVector(const A& a, const Vec& x) {
  if (a.colCount() != static_cast<int>(x.size()))
    throw MatrixException("matrix and vector must be of same order");
  Mat c(a.rowCount(), 1, 0.0);
  for (int i = 0; i < a.rowCount(); ++i) {
    double sum = 0.0;
    for (int j = 0; j < a.colCount(); ++j) sum += a(i, j) * x[static_cast<std::size_t>(j)];
    c(i, 0) = sum;
  }
  return c;
}

}  // namespace

// ---- sums and differences --------------------------------------------------
#define QEL_FULL_ELEMENTWISE(A, B)        \
  Mat operator+(const A& a, const B& b) { \
    return elementwiseFull(a, b, 1.0);    \
  }                                       \
  Mat operator-(const A& a, const B& b) { \
    return elementwiseFull(a, b, -1.0);   \
  }
QEL_FULL_ELEMENTWISE(Mat, DMat)
QEL_FULL_ELEMENTWISE(DMat, Mat)
QEL_FULL_ELEMENTWISE(Mat, SMat)
QEL_FULL_ELEMENTWISE(SMat, Mat)
QEL_FULL_ELEMENTWISE(Mat, UMat)
QEL_FULL_ELEMENTWISE(UMat, Mat)
QEL_FULL_ELEMENTWISE(SMat, UMat)
QEL_FULL_ELEMENTWISE(UMat, SMat)
#undef QEL_FULL_ELEMENTWISE

#define QEL_PACKED_ELEMENTWISE(R, A, B, label, lower)      \
  R operator+(const A& a, const B& b) {                    \
    return elementwisePacked<R>(label, a, b, 1.0, lower);  \
  }                                                        \
  R operator-(const A& a, const B& b) {                    \
    return elementwisePacked<R>(label, a, b, -1.0, lower); \
  }
QEL_PACKED_ELEMENTWISE(SMat, DMat, SMat, kAddition, true)
QEL_PACKED_ELEMENTWISE(SMat, SMat, DMat, kAddition, true)
QEL_PACKED_ELEMENTWISE(SMat, SMat, SMat, kAddition, true)
QEL_PACKED_ELEMENTWISE(UMat, DMat, UMat, kUpper, false)
QEL_PACKED_ELEMENTWISE(UMat, UMat, DMat, kUpper, false)
QEL_PACKED_ELEMENTWISE(UMat, UMat, UMat, kUpper, false)
#undef QEL_PACKED_ELEMENTWISE

DMat operator+(const DMat& a, const DMat& b) {
  return elementwiseDiagonal(a, b, 1.0);
}
DMat operator-(const DMat& a, const DMat& b) {
  return elementwiseDiagonal(a, b, -1.0);
}

Mat& operator+=(Mat& a, const DMat& b) {
  checkEqualDimensions("matrix += diagonal", a.rowCount(), a.colCount(), b.size(), b.size());
  for (int i = 0; i < b.size(); ++i) a(i, i) += b(i, i);
  return a;
}

// ---- scalar products ------------------------------------------------------
Mat operator*(double k, const Mat& a) {
  Mat c(a);
  return c *= k;
}
Mat operator*(const Mat& a, double k) {
  return k * a;
}
SMat operator*(double k, const SMat& a) {
  return UpperUnaryOp(a, k);
}
SMat operator*(const SMat& a, double k) {
  return UpperUnaryOp(a, k);
}
UMat operator*(double k, const UMat& a) {
  return UpperUnaryOp(a, k);
}
UMat operator*(const UMat& a, double k) {
  return UpperUnaryOp(a, k);
}
DMat operator*(double k, const DMat& a) {
  return UpperUnaryOp(a, k);
}
DMat operator*(const DMat& a, double k) {
  return UpperUnaryOp(a, k);
}

// ---- products ---------------------------------------------------------------
Mat operator*(const Mat& a, const Mat& b) {
  return fullMultiplyTemplate(a, b);
}
Mat operator*(const Mat& a, const SMat& b) {
  return fullMultiplyTemplate(a, b);
}
Mat operator*(const Mat& a, const UMat& b) {
  return fullMultiplyTemplate(a, b);
}
Mat operator*(const SMat& a, const Mat& b) {
  return fullMultiplyTemplate(a, b);
}
Mat operator*(const SMat& a, const SMat& b) {
  return fullMultiplyTemplate(a, b);
}
Mat operator*(const SMat& a, const UMat& b) {
  return fullMultiplyTemplate(a, b);
}
Mat operator*(const UMat& a, const Mat& b) {
  return fullMultiplyTemplate(a, b);
}
Mat operator*(const UMat& a, const SMat& b) {
  return fullMultiplyTemplate(a, b);
}
Mat operator*(const Mat& a, const DMat& b) {
  return DiagonalMultiplyTemplate<Mat>(b, a, false);
}
Mat operator*(const DMat& a, const Mat& b) {
  return DiagonalMultiplyTemplate<Mat>(a, b, true);
}
Mat operator*(const SMat& a, const DMat& b) {
  return DiagonalMultiplyTemplate<Mat>(b, Mat(a), false);
}
Mat operator*(const DMat& a, const SMat& b) {
  return DiagonalMultiplyTemplate<Mat>(a, Mat(b), true);
}
UMat operator*(const UMat& a, const DMat& b) {
  return DiagonalMultiplyTemplate<UMat>(b, a, false);
}
UMat operator*(const DMat& a, const UMat& b) {
  return DiagonalMultiplyTemplate<UMat>(a, b, true);
}
UMat operator*(const UMat& a, const UMat& b) {
  return SquareMultiplyTemplate(a, b);
}
DMat operator*(const DMat& a, const DMat& b) {
  checkMultiplyDimensions(a.colCount(), b.rowCount());
  DMat c(a.size());
  for (int i = 0; i < a.size(); ++i) c(i, i) = a(i, i) * b(i, i);
  return c;
}
Mat& operator*=(Mat& a, const Mat& b) {
  a = a * b;
  return a;
}
DMat& operator*=(DMat& a, const DMat& b) {
  a = a * b;
  return a;
}

Mat SlowMatrixMultiply(const Mat& a, const Mat& b) {
  checkMultiplyDimensions(a.colCount(), b.rowCount());
  Mat c(a.rowCount(), b.colCount(), 0.0);
  for (int i = 0; i < a.rowCount(); ++i) {
    for (int j = 0; j < b.colCount(); ++j) {
      double sum = 0.0;
      for (int k = 0; k < a.colCount(); ++k) sum += a(i, k) * b(k, j);
      c(i, j) = sum;
    }
  }
  return c;
}

namespace {

// Sum of x[k] y[k stride] over k below count, two terms a step.
double unrolledDot(const double* x, std::size_t xStride, const double* y, std::size_t yStride,
                   int count) {
  double even = 0.0;
  double odd = 0.0;
  int k = 0;
  for (; k + 1 < count; k += 2) {
    even += x[k * xStride] * y[k * yStride];
    odd += x[(k + 1) * xStride] * y[(k + 1) * yStride];
  }
  if (k < count) even += x[k * xStride] * y[k * yStride];
  return even + odd;
}

}  // namespace

void multiplyLeftTranspose(const Mat& a, const Mat& b, Mat& c) {
  c.ResizeStorage(a.colCount(), b.colCount(), 0.0);
  const std::size_t na = a.colCount();
  const std::size_t nb = b.colCount();
  for (int i = 0; i < a.colCount(); ++i) {
    for (int j = 0; j < b.colCount(); ++j) {
      c(i, j) = unrolledDot(a.data() + i, na, b.data() + j, nb, a.rowCount());
    }
  }
}

void multiplyRightTranspose(const Mat& a, const Mat& b, Mat& c) {
  c.ResizeStorage(a.rowCount(), b.rowCount(), 0.0);
  const std::size_t n = a.colCount();
  for (int i = 0; i < a.rowCount(); ++i) {
    for (int j = 0; j < b.rowCount(); ++j) {
      c(i, j) = unrolledDot(a.data() + i * n, 1, b.data() + j * n, 1, a.colCount());
    }
  }
}

// ---- with a vector ---------------------------------------------------------
Mat& operator+=(Mat& a, const Vec& x) {
  checkColumnOfVector(a, x, "op+= matrix and vector must be of same order");
  for (int i = 0; i < a.rowCount(); ++i) a(i, 0) += x[static_cast<std::size_t>(i)];
  return a;
}
Mat& operator-=(Mat& a, const Vec& x) {
  checkColumnOfVector(a, x, "op-= matrix and vector must be of same order");
  for (int i = 0; i < a.rowCount(); ++i) a(i, 0) -= x[static_cast<std::size_t>(i)];
  return a;
}
Mat operator+(const Mat& a, const Vec& x) {
  Mat c(a);
  return c += x;
}
Mat operator-(const Mat& a, const Vec& x) {
  Mat c(a);
  return c -= x;
}
Mat operator*(const Mat& a, const Vec& x) {
  return timesVector(a, x);
}
Mat operator*(const SMat& a, const Vec& x) {
  return timesVector(a, x);
}

}  // namespace matrix_library
}  // namespace qel
