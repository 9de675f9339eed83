// Eigenvalues and eigenvectors of a real symmetric matrix: Householder
// reduction to tridiagonal form with accumulated transformations, then the
// QL iteration with implicit shifts (EISPACK tred2 and tql2; Martin, Reinsch
// and Wilkinson, Numer. Math. 11 (1968); Bowdler et al., Numer. Math. 11
// (1968)).
//
// The transformations are kept transposed: row r of the work array z is
// column r of the eigenvector matrix, so that the long inner loops of the
// accumulation and every plane rotation run along contiguous rows.
#include <cfloat>
#include <cmath>
#include <cstddef>
#include <utility>

#include "utilities/MathUtilities.h"
#include "utilities/MatrixLibrary/matrix_functions.h"

namespace qel {
namespace matrix_library {

namespace {

constexpr int kMaxIterations = 30;

class Work {
 public:
  explicit Work(int n) : n_(n), z_(static_cast<std::size_t>(n) * n, 0.0) {}
  double& operator()(int r, int c) { return z_[static_cast<std::size_t>(r) * n_ + c]; }
  double* row(int r) { return z_.data() + static_cast<std::size_t>(r) * n_; }

 private:
  int n_;
  std::vector<double> z_;
};

// The spacing of doubles at 1, found by halving.
double machineEpsilon() {
  volatile double value = 1.0;
  volatile double sum = 2.0;
  while (sum != 1.0) {
    value = value / 2.0;
    sum = 1.0 + value / 2.0;
  }
  return value;
}

// sqrt(a^2 + b^2) without destructive underflow or overflow: the larger
// magnitude times the root of 1 + ratio^2, a ratio too small to square being
// flushed to 0.
double pythag(double a, double b) {
  double big = std::fabs(a);
  double small = std::fabs(b);
  if (mCompareWithFuzz(big, small, 0.0) < 0) std::swap(big, small);
  if (!(big > 0.0)) return big == 0.0 ? small : big;
  if (std::isinf(big)) return big;
  double ratio = small / big;
  if (ratio < 1.4916681462400413e-154) ratio = 0.0;  // sqrt(DBL_MIN)
  return big * std::sqrt(1.0 + ratio * ratio);
}

// tred2 on z = V' (z(c, r) = V(r, c)); z holds the lower triangle of A
// transposed on entry. Leaves the diagonal in d, the subdiagonal in e(1..n-1)
// with e(0) = 0, and the orthogonal transformation in z.
void tridiagonalise(Work& z, int n, std::vector<double>& d, std::vector<double>& e) {
  for (int j = 0; j < n; ++j) d[j] = z(j, n - 1);
  for (int i = n - 1; i > 0; --i) {
    double scale = 0.0;
    double h = 0.0;
    for (int k = 0; k < i; ++k) scale += std::fabs(d[k]);
    if (scale == 0.0) {
      e[i] = d[i - 1];
      for (int j = 0; j < i; ++j) {
        d[j] = z(j, i - 1);
        z(j, i) = 0.0;
        z(i, j) = 0.0;
      }
      d[i] = h;
      continue;
    }
    for (int k = 0; k < i; ++k) {
      d[k] /= scale;
      h += d[k] * d[k];
    }
    double f = d[i - 1];
    double g = -mTransferSign(std::sqrt(h), f);
    e[i] = scale * g;
    h -= f * g;
    d[i - 1] = f - g;
    for (int j = 0; j < i; ++j) e[j] = 0.0;
    for (int j = 0; j < i; ++j) {
      f = d[j];
      z(i, j) = f;
      double* zj = z.row(j);
      g = e[j] + zj[j] * f;
      for (int k = j + 1; k < i; ++k) {
        g += zj[k] * d[k];
        e[k] += zj[k] * f;
      }
      e[j] = g;
    }
    f = 0.0;
    for (int j = 0; j < i; ++j) {
      e[j] /= h;
      f += e[j] * d[j];
    }
    const double hh = f / (h + h);
    for (int j = 0; j < i; ++j) e[j] -= hh * d[j];
    for (int j = 0; j < i; ++j) {
      f = d[j];
      g = e[j];
      double* zj = z.row(j);
      for (int k = j; k < i; ++k) zj[k] -= f * e[k] + g * d[k];
      d[j] = zj[i - 1];
      zj[i] = 0.0;
    }
    d[i] = h;
  }
  // Accumulate the transformations.
  for (int i = 0; i + 1 < n; ++i) {
    z(i, n - 1) = z(i, i);
    z(i, i) = 1.0;
    const double h = d[i + 1];
    double* zi1 = z.row(i + 1);
    if (h != 0.0) {
      for (int k = 0; k <= i; ++k) d[k] = zi1[k] / h;
      for (int j = 0; j <= i; ++j) {
        double* zj = z.row(j);
        double g = 0.0;
        for (int k = 0; k <= i; ++k) g += zi1[k] * zj[k];
        for (int k = 0; k <= i; ++k) zj[k] -= g * d[k];
      }
    }
    for (int k = 0; k <= i; ++k) zi1[k] = 0.0;
  }
  for (int j = 0; j < n; ++j) {
    d[j] = z(j, n - 1);
    z(j, n - 1) = 0.0;
  }
  z(n - 1, n - 1) = 1.0;
  e[0] = 0.0;
}

// Rows i and i+1 of z (columns of V) turned by the rotation (c, s).
void rotate(Work& z, int n, int i, double c, double s) {
  double* zi = z.row(i);
  double* zi1 = z.row(i + 1);
  for (int k = 0; k < n; ++k) {
    const double h = zi1[k];
    zi1[k] = s * zi[k] + c * h;
    zi[k] = c * zi[k] - s * h;
  }
}

bool negligibleAgainst(double value, double tst) {
  return mCompareWithFuzz(std::fabs(value), tst, 0.0) <= 0;
}

// tql2: the eigenvalues of the tridiagonal (d, e) into d, the rotations into
// z. Returns -1, or the index l whose eigenvalue failed to converge.
int diagonalise(Work& z, int n, std::vector<double>& d, std::vector<double>& e) {
  for (int i = 1; i < n; ++i) e[i - 1] = e[i];
  e[n - 1] = 0.0;
  const double eps = machineEpsilon();
  double f = 0.0;
  double tst = 0.0;
  for (int l = 0; l < n; ++l) {
    tst = std::fmax(tst, eps * (std::fabs(d[l]) + std::fabs(e[l])));
    int m = l;
    while (m < n - 1 && !negligibleAgainst(e[m], tst)) ++m;
    if (m > l) {
      int iterations = 0;
      do {
        if (iterations == kMaxIterations) return l;
        ++iterations;
        // The shift.
        double g = d[l];
        double p = (d[l + 1] - g) / (2.0 * e[l]);
        double r = pythag(p, 1.0);
        d[l] = e[l] / (p + mTransferSign(r, p));
        d[l + 1] = e[l] * (p + mTransferSign(r, p));
        const double dl1 = d[l + 1];
        double h = g - d[l];
        for (int i = l + 2; i < n; ++i) d[i] -= h;
        f += h;
        // The implicit QL sweep.
        p = d[m];
        double c = 1.0, c2 = 1.0, c3 = 1.0;
        const double el1 = e[l + 1];
        double s = 0.0, s2 = 0.0;
        for (int i = m - 1; i >= l; --i) {
          c3 = c2;
          c2 = c;
          s2 = s;
          g = c * e[i];
          h = c * p;
          r = pythag(p, e[i]);
          e[i + 1] = s * r;
          if (r == 0.0) {
            s = 0.0;
            c = 1.0;
          } else {
            s = e[i] / r;
            c = p / r;
          }
          p = c * d[i] - s * g;
          d[i + 1] = h + s * (c * g + s * d[i]);
          rotate(z, n, i, c, s);
        }
        p = dl1 != 0.0 ? -s * s2 * c3 * el1 * e[l] / dl1 : 0.0;
        e[l] = s * p;
        d[l] = c * p;
      } while (!negligibleAgainst(e[l], tst));
    }
    d[l] += f;
    e[l] = 0.0;
  }
  return -1;
}

// Ascending selection sort; a later value is taken only if strictly smaller
// beyond the fuzz, so equal values keep their order.
void sortAscending(Work& z, int n, std::vector<double>& d) {
  for (int i = 0; i + 1 < n; ++i) {
    int k = i;
    double smallest = d[i];
    for (int j = i + 1; j < n; ++j) {
      if (mCompareWithFuzz(d[j], smallest, 0.0) < 0) {
        k = j;
        smallest = d[j];
      }
    }
    if (k != i) {
      d[k] = d[i];
      d[i] = smallest;
      std::swap_ranges(z.row(i), z.row(i) + n, z.row(k));
    }
  }
}

}  // namespace

int EigenSystems(const Mat& lhs, Vec& values, Mat& vectors) {
  const int iNumRows = lhs.rowCount();
  QEL_ALLEGE(iNumRows == lhs.colCount());
  const int n = iNumRows;
  values.assign(static_cast<std::size_t>(n), 0.0);
  vectors.ResizeStorage(n, n, 0.0);
  if (n == 0) return 0;
  Work z(n);
  for (int j = 0; j < n; ++j) {
    for (int k = j; k < n; ++k) z(j, k) = lhs(k, j);
  }
  std::vector<double> e(static_cast<std::size_t>(n), 0.0);
  tridiagonalise(z, n, values, e);
  const int failed = diagonalise(z, n, values, e);
  if (failed < 0) sortAscending(z, n, values);
  for (int r = 0; r < n; ++r) {
    for (int c = 0; c < n; ++c) vectors(r, c) = z(c, r);
  }
  return failed < 0 ? 0 : failed;
}

}  // namespace matrix_library
}  // namespace qel
