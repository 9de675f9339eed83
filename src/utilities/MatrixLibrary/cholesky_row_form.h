// The row form of the Cholesky factorisation, shared by the value matrices
// and the legacy polymorphic ones. Both keep the factor U (A = U'U) packed
// by upper rows; the work runs on the transposed factor L = U' held as a
// dense row-major lower triangle, where the dot product of columns i and j
// of U is a dot product of two contiguous rows of L.
#ifndef QEL_SRC_UTILITIES_MATRIXLIBRARY_CHOLESKY_ROW_FORM_H
#define QEL_SRC_UTILITIES_MATRIXLIBRARY_CHOLESKY_ROW_FORM_H

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <vector>

#include "utilities/MatrixLibrary/simd_pair.h"

namespace qel {
namespace cholesky_detail {

// Sum of x[k] y[k] for k below count, in four interleaved partial sums (a
// fixed order, so results do not depend on the caller): sums 0 and 1 share
// one register pair, sums 2 and 3 the other.
template <class T>
T rowDot(const T* x, const T* y, int count) {
  T s0 = T(), s1 = T(), s2 = T(), s3 = T();
  int k = 0;
  for (; k + 3 < count; k += 4) {
    s0 += x[k] * y[k];
    s1 += x[k + 1] * y[k + 1];
    s2 += x[k + 2] * y[k + 2];
    s3 += x[k + 3] * y[k + 3];
  }
  for (; k < count; ++k) s0 += x[k] * y[k];
  return (s0 + s1) + (s2 + s3);
}

inline double rowDot(const double* x, const double* y, int count) {
  simd::Pair low = simd::broadcast(0.0);
  simd::Pair high = low;
  int k = 0;
  for (; k + 3 < count; k += 4) {
    low += simd::load(x + k) * simd::load(y + k);
    high += simd::load(x + k + 2) * simd::load(y + k + 2);
  }
  double s0 = low[0];
  for (; k < count; ++k) s0 += x[k] * y[k];
  return (s0 + low[1]) + (high[0] + high[1]);
}

// rowDot(x, y, count) and rowDot(x, z, count) in one pass over x, each with
// exactly the arithmetic of rowDot.
template <class T>
void rowDot2(const T* x, const T* y, const T* z, int count, T* dy, T* dz) {
  *dy = rowDot(x, y, count);
  *dz = rowDot(x, z, count);
}

inline void rowDot2(const double* x, const double* y, const double* z, int count, double* dy,
                    double* dz) {
  simd::Pair yLow = simd::broadcast(0.0), yHigh = yLow, zLow = yLow, zHigh = yLow;
  int k = 0;
  for (; k + 3 < count; k += 4) {
    const simd::Pair xLow = simd::load(x + k), xHigh = simd::load(x + k + 2);
    yLow += xLow * simd::load(y + k);
    yHigh += xHigh * simd::load(y + k + 2);
    zLow += xLow * simd::load(z + k);
    zHigh += xHigh * simd::load(z + k + 2);
  }
  double y0 = yLow[0], z0 = zLow[0];
  for (; k < count; ++k) {
    y0 += x[k] * y[k];
    z0 += x[k] * z[k];
  }
  *dy = (y0 + yLow[1]) + (yHigh[0] + yHigh[1]);
  *dz = (z0 + zLow[1]) + (zHigh[0] + zHigh[1]);
}

// Factors the columns j >= start of the m by m lower triangle l (row j of l
// is column j of U). Rows below start of every column are taken as already
// factored. For each column j, with a residual starting at 0: for i below j,
// l(j,i) = (l(j,i) - dot of rows i and j over the first i entries) / l(i,i)
// when i >= start, and the residual gains l(j,i)^2; then d = l(j,j) -
// residual. d <= 0 (not NaN) stops: the result is j and *residual = |d|.
// Otherwise l(j,j) = sqrt(d). Success returns -1, *residual holding the last
// column's sum of squares.
//
// Columns go two at a time (j and k = j + 1), so that each earlier row is
// read once for both; every element gets exactly the arithmetic of the
// one-column order, and a failure at j restores column k as it was.
template <class T>
int choleskyRowForm(T* l, int m, int start, T* residual) {
  T sumJ = T();
  std::vector<T> saved;
  for (int j = start; j < m; ++j) {
    T* lj = l + static_cast<std::size_t>(j) * m;
    T* lk = j + 1 < m ? lj + m : nullptr;
    if (lk) saved.assign(lk, lk + j);
    sumJ = T();
    T sumK = T();
    for (int i = 0; i < j; ++i) {
      const T* li = l + static_cast<std::size_t>(i) * m;
      if (i >= start) {
        T dj = T(), dk = T();
        if (lk) {
          rowDot2(li, lj, lk, i, &dj, &dk);
          lk[i] = (lk[i] - dk) / li[i];
        } else {
          dj = rowDot(li, lj, i);
        }
        lj[i] = (lj[i] - dj) / li[i];
      }
      sumJ += lj[i] * lj[i];
      if (lk) sumK += lk[i] * lk[i];
    }
    const T d = lj[j] - sumJ;
    if (d <= T()) {
      if (lk) std::copy(saved.begin(), saved.end(), lk);
      *residual = std::fabs(d);
      return j;
    }
    lj[j] = std::sqrt(d);
    if (!lk) break;
    // Column k: its last off-diagonal element, then its pivot.
    ++j;
    lk[j - 1] = (lk[j - 1] - rowDot(lj, lk, j - 1)) / lj[j - 1];
    sumK += lk[j - 1] * lk[j - 1];
    const T dk = lk[j] - sumK;
    sumJ = sumK;
    if (dk <= T()) {
      *residual = std::fabs(dk);
      return j;
    }
    lk[j] = std::sqrt(dk);
  }
  *residual = sumJ;
  return -1;
}

// The same on the packed upper triangle (i m - i(i+1)/2 + j for i <= j).
template <class T>
int choleskyPackedUpper(std::vector<T>& packed, int m, int start, T* residual) {
  std::vector<T> l(static_cast<std::size_t>(m) * m, T());
  std::size_t k = 0;
  for (int i = 0; i < m; ++i) {
    for (int j = i; j < m; ++j) l[static_cast<std::size_t>(j) * m + i] = packed[k++];
  }
  const int failed = choleskyRowForm(l.data(), m, start, residual);
  k = 0;
  for (int i = 0; i < m; ++i) {
    for (int j = i; j < m; ++j) packed[k++] = l[static_cast<std::size_t>(j) * m + i];
  }
  return failed;
}

}  // namespace cholesky_detail
}  // namespace qel

#endif
