// Solutions, inverses, determinants, Cholesky factors and eigensystems of the
// value matrices against mpmath at 50 digits
// (tools/reference/gen_matrix_reference.py): forward errors within
// c n cond eps, backward errors within 10 n eps, eigenvalues within
// 10 n eps ||A||, residuals and orthogonality within 10 n eps.
#include <gtest/gtest.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <string>
#include <vector>

#include "reference_data.h"
#include "utilities/MatrixLibrary/matrix_functions.h"
#include "utilities/MatrixLibrary/matrix_ludecomposition.h"

namespace {

using namespace qel::matrix_library;
const double kEps = DBL_EPSILON;

struct Case {
  std::string kind, name;
  int n;
  double scale;  // condition number (lu, chol) or norm (eig)
  std::vector<double> rest;
  std::size_t next = 0;
  std::vector<double> take(std::size_t count) {
    std::vector<double> out(rest.begin() + next, rest.begin() + next + count);
    next += count;
    return out;
  }
  Mat takeMatrix() { return Mat(take(static_cast<std::size_t>(n) * n), n); }
};

std::vector<Case> cases(const std::string& kind) {
  std::vector<Case> out;
  for (const auto& row : qeltest::loadReferenceData("matrix_reference.csv", 2)) {
    if (row.text[0] != kind) continue;
    Case c{row.text[0], row.text[1], static_cast<int>(row.numbers[0]), row.numbers[1], {}};
    c.rest.assign(row.numbers.begin() + 2, row.numbers.end());
    out.push_back(c);
  }
  EXPECT_FALSE(out.empty());
  return out;
}

double normInf(const Mat& a) {
  double best = 0.0;
  for (int i = 0; i < a.rowCount(); ++i) {
    double sum = 0.0;
    for (int j = 0; j < a.colCount(); ++j) sum += std::fabs(a(i, j));
    best = std::max(best, sum);
  }
  return best;
}

double normInf(const Vec& x) {
  double best = 0.0;
  for (double v : x) best = std::max(best, std::fabs(v));
  return best;
}

Vec difference(const Vec& x, const Vec& y) {
  Vec d(x);
  for (std::size_t k = 0; k < d.size(); ++k) d[k] -= y[k];
  return d;
}

Mat differenceMatrix(const Mat& a, const Mat& b) {
  Mat d(a);
  return d -= b;
}

TEST(MatrixReference, LuSolveInverseDeterminant) {
  for (Case c : cases("lu")) {
    SCOPED_TRACE(c.name);
    const Mat a = c.takeMatrix();
    const Vec b = c.take(c.n), xRef = c.take(c.n);
    const double detRef = c.take(1)[0];
    const Mat invRef = c.takeMatrix();
    LUDecomposition lu(a);
    Vec x;
    if (lu.singular()) {
      // Only the worst-conditioned Hilbert matrices may fall below the
      // threshold; their smallest pivot is then truly below 1e-13.
      EXPECT_GT(c.scale, 1e15);
      EXPECT_FALSE(lu.Solve(b, &x));
      EXPECT_TRUE(x.empty());
      continue;
    }
    const double forward = 4.0 * c.n * c.scale * kEps;
    ASSERT_TRUE(lu.Solve(b, &x));
    EXPECT_LE(normInf(difference(x, xRef)) / normInf(xRef), forward);
    const Vec ax = (a * x).getColVector(0);
    EXPECT_LE(normInf(difference(ax, b)) / (normInf(a) * normInf(x)), 10.0 * c.n * kEps);
    double det = 0.0;
    ASSERT_TRUE(determinant(a, &det));
    EXPECT_LE(std::fabs(det - detRef) / std::fabs(detRef), forward);
    Mat inv;
    ASSERT_TRUE(inverse(a, &inv));
    EXPECT_LE(normInf(differenceMatrix(inv, invRef)) / normInf(invRef), forward);
    EXPECT_LE(normInf(differenceMatrix(a * inv, Mat(DMat(c.n, 1.0)))) / (normInf(a) * normInf(inv)),
              10.0 * c.n * kEps);
  }
}

TEST(MatrixReference, CholeskyFactorAndInverse) {
  for (Case c : cases("chol")) {
    SCOPED_TRACE(c.name);
    const Mat a = c.takeMatrix();
    const Mat lowerRef = c.takeMatrix();
    const Mat invRef = c.takeMatrix();
    UMat u;
    ASSERT_TRUE(CholeskyDecomp(a.ConvertToSmatrix(), &u));
    const Mat full(u);
    const double forward = 4.0 * c.n * c.scale * kEps;
    EXPECT_LE(normInf(differenceMatrix(full, lowerRef.transpose())) / normInf(lowerRef),
              std::sqrt(forward) + forward);
    Mat product;
    multiplyLeftTranspose(full, full, product);
    EXPECT_LE(normInf(differenceMatrix(product, a)) / normInf(a), 10.0 * c.n * kEps);
    const Mat inv(CholeskyInverse(u));
    EXPECT_LE(normInf(differenceMatrix(inv, invRef)) / normInf(invRef), forward);
    Vec b(static_cast<std::size_t>(c.n));
    for (int i = 0; i < c.n; ++i) b[static_cast<std::size_t>(i)] = 1.0 - 0.25 * i;
    const Vec x = CholeskyBackSub(u, b);
    const Vec ax = (a * x).getColVector(0);
    EXPECT_LE(normInf(difference(ax, b)) / (normInf(a) * normInf(x)), 10.0 * c.n * kEps);
  }
}

TEST(MatrixReference, EigenSystems) {
  for (Case c : cases("eig")) {
    SCOPED_TRACE(c.name);
    const Mat a = c.takeMatrix();
    const Vec valuesRef = c.take(c.n);
    Vec values;
    Mat vectors;
    ASSERT_EQ(EigenSystems(a, values, vectors), 0);
    const double tolerance = 10.0 * c.n * kEps * std::max(c.scale, DBL_MIN);
    for (int k = 0; k < c.n; ++k) EXPECT_NEAR(values[k], valuesRef[k], tolerance) << k;
    Mat vd(vectors);
    for (int j = 0; j < c.n; ++j) {
      for (int i = 0; i < c.n; ++i) vd(i, j) *= values[static_cast<std::size_t>(j)];
    }
    EXPECT_LE(normInf(differenceMatrix(a * vectors, vd)), tolerance);
    Mat gram;
    multiplyLeftTranspose(vectors, vectors, gram);
    EXPECT_LE(normInf(differenceMatrix(gram, Mat(DMat(c.n, 1.0)))), 10.0 * c.n * kEps);
    // The member form is the same computation.
    Vec memberValues;
    Mat memberVectors;
    EXPECT_EQ(a.EigenSystems(memberValues, memberVectors), 0);
    EXPECT_EQ(memberValues, values);
  }
}

// The matrices of tools/reference/gen_matrix_r.R, rebuilt from their
// integer formulas.
Mat rGeneral(int n) {
  Mat g(n, n, 0.0);
  for (int i = 0; i < n; ++i)
    for (int j = 0; j < n; ++j)
      g(i, j) = ((3 * i + 7 * j + i * j) % 29 - 14) / 14.0 + (i == j) * 2.0;
  return g;
}

Mat rSymmetric(int n) {
  Mat s(n, n, 0.0);
  for (int i = 0; i < n; ++i)
    for (int j = 0; j < n; ++j) s(i, j) = ((i + 1) * (j + 1) % 23 - 11) / 11.0 + (i == j) * (n + i);
  return s;
}

TEST(MatrixReference, AgainstLapackThroughR) {
  int seen = 0;
  for (const auto& row : qeltest::loadReferenceData("matrix_r_lapack.csv", 1)) {
    const std::string& kind = row.text[0];
    const int n = static_cast<int>(row.numbers[0]);
    const double* r = row.numbers.data() + 1;
    SCOPED_TRACE(kind + " " + std::to_string(n));
    ++seen;
    if (kind == "solve") {
      Vec b(static_cast<std::size_t>(n)), x;
      for (int i = 0; i < n; ++i) b[static_cast<std::size_t>(i)] = i % 5 - 2;
      ASSERT_TRUE(LUDecomposition(rGeneral(n)).Solve(b, &x));
      const Vec xR(r + 1, r + 1 + n);
      EXPECT_LE(normInf(difference(x, xR)) / normInf(xR), 4.0 * n * r[0] * kEps);
    } else if (kind == "det") {
      double det = 0.0;
      ASSERT_TRUE(determinant(rGeneral(n), &det));
      EXPECT_NEAR(std::log(std::fabs(det)), r[0], 4.0 * n * kEps * r[0]);
      EXPECT_EQ(det < 0 ? -1.0 : 1.0, r[1]);
    } else if (kind == "chol") {
      const UMat u = CholeskyDecompWithThrow(rSymmetric(n).ConvertToSmatrix());
      for (int i = 0; i < n; ++i) EXPECT_NEAR(u(i, i), r[1 + i], 4.0 * n * r[0] * kEps * r[1 + i]);
    } else {
      Vec values;
      Mat vectors;
      ASSERT_EQ(EigenSystems(rSymmetric(n), values, vectors), 0);
      const double tolerance = 10.0 * n * kEps * r[0];
      for (int k = 0; k < n; ++k) {
        EXPECT_NEAR(values[static_cast<std::size_t>(k)], r[1 + k], tolerance);
        // An eigenvector is as accurate as its value is separated.
        double gap = r[0];
        if (k > 0) gap = std::min(gap, r[1 + k] - r[k]);
        if (k + 1 < n) gap = std::min(gap, r[2 + k] - r[1 + k]);
        EXPECT_NEAR(std::fabs(vectors(n - 1, k)), r[1 + n + k], tolerance / gap);
      }
    }
  }
  EXPECT_EQ(seen, 8);
}

}  // namespace
