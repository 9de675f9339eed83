// Value matrices: layouts and zero slots, the operator table's result kinds
// and words, tiled against plain products, resumable Cholesky, singularity
// edges, bad input, and expression trees against their evaluated form.
#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <limits>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include "utilities/MatrixLibrary/matrix_expression.h"
#include "utilities/MatrixLibrary/matrix_functions.h"
#include "utilities/MatrixLibrary/matrix_ludecomposition.h"

namespace {

using namespace qel::matrix_library;
namespace ex = qel::matrix_library::expressions;

template <class Fn>
std::string failureText(Fn fn) {
  try {
    fn();
  } catch (const std::exception& e) {
    return e.what();
  }
  return "no exception";
}

Mat randomMatrix(int rows, int cols, std::mt19937& gen) {
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  Mat a(rows, cols, 0.0);
  for (int i = 0; i < rows; ++i)
    for (int j = 0; j < cols; ++j) a(i, j) = u(gen);
  return a;
}

double maxDifference(const Mat& a, const Mat& b) {
  EXPECT_EQ(a.rowCount(), b.rowCount());
  EXPECT_EQ(a.colCount(), b.colCount());
  double worst = 0.0;
  for (int i = 0; i < a.rowCount(); ++i)
    for (int j = 0; j < a.colCount(); ++j) worst = std::fmax(worst, std::fabs(a(i, j) - b(i, j)));
  return worst;
}

TEST(MatrixStorage, LayoutsAndZeroSlots) {
  SMat s(6, 0.0);
  s(2, 5) = 7.0;
  EXPECT_EQ(s(5, 2), 7.0);
  EXPECT_EQ(s.storage()[5 * 6 / 2 + 2], 7.0);
  UMat u(4, 1.0);
  u(3, 1) = 9.0;  // below the diagonal: lost
  EXPECT_EQ(u(3, 1), 0.0);
  EXPECT_EQ(u.storage().size(), 10u);
  u(1, 2) = 5.0;
  EXPECT_EQ(u.storage()[1 * 4 - 1 + 2], 5.0);
  DMat d(3, 2.0);
  d(0, 1) = 4.0;
  EXPECT_EQ(static_cast<const DMat&>(d)(0, 1), 0.0);
  EXPECT_TRUE(Mat(0, 0, 0.0).empty());
  const Mat row(Vec{1, 2, 3}, 3);
  const Mat t = row.transpose();
  EXPECT_EQ(t.rowCount(), 3);
  EXPECT_EQ(t.colCount(), 1);
  EXPECT_EQ(t.getColVector(0), (Vec{1, 2, 3}));
  Mat sym(Vec{1, 2, 2, 1}, 2);
  EXPECT_EQ(Mat(sym.ConvertToSmatrix()).getRowVector(1), (Vec{2, 1}));
  sym(0, 1) = 2.5;
  EXPECT_EQ(failureText([&] { sym.ConvertToSmatrix(); }),
            "Smatrix cast: result not a symmetric matrix");
  EXPECT_EQ(mUTmatrixToSmatrix(SmatrixToUTmatrix(s)).storage(), s.storage());
  std::ostringstream text;
  text << Vec{1, 2.5};
  show(text, 3.0);
  show(text, Mat(Vec{1, 2, 3, 4}, 2));
  EXPECT_EQ(text.str(), "[1, 2.5]<Value: 3>[1, 2]\n[3, 4]\n");
  Vec flat(1, -1.0);
  EXPECT_EQ(mFlattenmatrix(Mat(Vec{1, 2, 3, 4}, 2), flat, 1, false), 5);
  EXPECT_EQ(flat, (Vec{-1, 1, 3, 2, 4}));
  EXPECT_EQ(mFlattenmatrix(mUTmatrixToSmatrix(u), flat, 0, true), 10);
  EXPECT_EQ(flat[4], 5.0);  // (2, 1) after (0,0), (1,0), (1,1), (2,0)
}

TEST(MatrixOperators, ResultKindsAndWords) {
  std::mt19937 gen(3);
  const Mat a = randomMatrix(5, 5, gen);
  const SMat s = (a + a.transpose()).ConvertToSmatrix();
  UMat u(5);
  for (int i = 0; i < 5; ++i)
    for (int j = i; j < 5; ++j) u(i, j) = a(i, j);
  DMat d(5);
  for (int i = 0; i < 5; ++i) d(i, i) = 1.0 + i;
  const Mat S(s), U(u), D(d);
  // Every product of kinds equals the plain product of their full forms.
  const std::vector<std::pair<Mat, Mat>> products = {{a * s, SlowMatrixMultiply(a, S)},
                                                     {s * u, SlowMatrixMultiply(S, U)},
                                                     {Mat(u * u), SlowMatrixMultiply(U, U)},
                                                     {Mat(d * u), SlowMatrixMultiply(D, U)},
                                                     {Mat(u * d), SlowMatrixMultiply(U, D)},
                                                     {s * d, SlowMatrixMultiply(S, D)},
                                                     {Mat(d * d), SlowMatrixMultiply(D, D)},
                                                     {u * a, SlowMatrixMultiply(U, a)},
                                                     {Mat(s + d), S + D},
                                                     {Mat(u - d), U - D},
                                                     {Mat(s - s), S - S},
                                                     {s + u, S + U},
                                                     {Mat(2.0 * u), 2.0 * U},
                                                     {Mat(s * 3.0), 3.0 * S}};
  for (const auto& p : products) EXPECT_LE(maxDifference(p.first, p.second), 1e-14);
  const Mat big = randomMatrix(19, 21, gen), other = randomMatrix(21, 13, gen);
  EXPECT_LE(maxDifference(big * other, SlowMatrixMultiply(big, other)), 1e-13);
  Mat c;
  multiplyLeftTranspose(big, big, c);
  EXPECT_LE(maxDifference(c, SlowMatrixMultiply(big.transpose(), big)), 1e-13);
  multiplyRightTranspose(other, other, c);
  EXPECT_LE(maxDifference(c, SlowMatrixMultiply(other, other.transpose())), 1e-13);
  EXPECT_NEAR(mQuadraticForm(s, Vec{1, 0, 0, 0, 2}), s(0, 0) + 4 * s(0, 4) + 4 * s(4, 4), 1e-14);

  // Shapes that do not fit: the words of each operation (exact, or the
  // assertion's leading words).
  Mat m52(5, 4, 0.0), m32(3, 2, 0.0), m31(3, 1, 0.0);
  const std::vector<std::pair<std::function<void()>, std::string>> failures = {
      {[&] { a + DMat(4); }, "matrix addition : row counts are different"},
      {[&] { m52.ConvertToSmatrix(); }, "assertion failed: (rows == cols) "},
      {[&] { u + UMat(3); }, "upper matrix element wise op : row counts are different"},
      {[&] { d - DMat(2); }, "diagonal matrix elementwise op : row counts are different"},
      {[&] { m52 += d; }, "matrix += diagonal : col counts are different"},
      {[&] { a* Mat(4, 4, 1.0); }, "Matrix multiplication: incompatible orders"},
      {[&] { a* Vec(3); }, "matrix and vector must be of same order"},
      {[&] { m32 += Vec(3); }, "op+= matrix and vector must be of same order"},
      {[&] { m31 -= Vec(2); }, "op-= matrix and vector must be of same order"},
      {[&] { mQuadraticForm(Mat(2, 3, 0.0), Vec(3)); },
       "matrix::quadratic form is only defined for square matrices"},
      {[&] { mQuadraticForm(s, Vec(4)); },
       "matrix::matrix and vector have incompatible dimensions"},
      {[&] { DotProduct(a, 0, 1, 6); }, "matrix::number of products greater than dimension"}};
  for (const auto& [fn, words] : failures) {
    const std::string text = failureText(fn);
    EXPECT_TRUE(text == words || (words.back() == ' ' && text.rfind(words, 0) == 0)) << text;
  }
}

TEST(MatrixDecompositions, SingularityEdgesAndBadInput) {
  // Singularity is absolute: about 1e-14.
  for (const auto& [scale, singular] :
       std::vector<std::pair<double, bool>>{{1e-15, true}, {1e-13, false}, {0.0, true}}) {
    const Mat a(DMat(3, scale));
    double det = -1.0;
    EXPECT_EQ(determinant(a, &det), !singular) << scale;
    Mat inv(2, 2, 1.0);
    EXPECT_EQ(inverse(a, &inv), !singular);
    if (singular) {
      EXPECT_EQ(det, 0.0);
      EXPECT_TRUE(inv.empty());
      EXPECT_THROW(inverseWithThrow(a), MatrixSingular);
    }
  }
  const LUDecomposition zero(Mat(1, 1, 0.0));
  double det = 1.0;
  EXPECT_FALSE(zero.Determinant(&det));
  EXPECT_EQ(zero.factors().rowCount(), 0);
  EXPECT_THROW(zero.DeterminantWithThrow(), MatrixSingular);
  EXPECT_EQ(failureText([] { LUDecomposition(Mat(2, 3, 1.0)); }),
            "LU Decomp is defined for only square matrices");
  const std::string nullResult =
      failureText([] { LUDecomposition(Mat(2, 2, 1.0)).Determinant(nullptr); });
  EXPECT_EQ(nullResult.find("assertion failed: (result) "), 0u) << nullResult;
  EXPECT_NE(nullResult.find("matrix_ludecomposition.cpp: "), std::string::npos) << nullResult;
  EXPECT_NE(failureText([] { inverse(DMat(2), static_cast<DMat*>(nullptr)); }).find("(result)"),
            std::string::npos);
  EXPECT_NE(failureText([] { LUDecomposition(Mat(2, 2, 1.0)).Solve(Vec(2), nullptr); }).find("(x)"),
            std::string::npos);
  const Mat B(2, 2, 1.0);
  Mat X = B;
  LUDecomposition lu(Mat(DMat(2, 2.0)));
  EXPECT_NE(failureText([&] { lu.Solve(X, &X); }).find("(&B != X)"), std::string::npos);
  // NaN and infinite entries end without hanging.
  const double nan = std::numeric_limits<double>::quiet_NaN();
  for (double bad : {nan, std::numeric_limits<double>::infinity()}) {
    Mat a(DMat(4, 1.0));
    a(2, 1) = a(1, 2) = bad;
    Vec values;
    Mat vectors;
    EigenSystems(a, values, vectors);
    LUDecomposition(a).Determinant(&det);
    SMat sa(4, 0.0);
    sa(0, 0) = sa(1, 1) = sa(2, 2) = sa(3, 3) = 4.0;
    sa(2, 1) = bad;
    UMat u;
    EXPECT_FALSE(CholeskyDecomp(sa, &u));
    EXPECT_THROW(a.ConvertToSmatrix(), MatrixException);
  }
  Vec values;
  Mat vectors;
  EXPECT_EQ(failureText([&] {
              EigenSystems(Mat(2, 3, 0.0), values, vectors);
            }).find("assertion failed: (iNumRows == lhs.colCount())"),
            0u);
  // Repeated eigenvalues keep their order: the unit vectors stay in place.
  EXPECT_EQ(EigenSystems(Mat(DMat(3, 2.0)), values, vectors), 0);
  EXPECT_EQ(maxDifference(vectors, Mat(DMat(3, 1.0))), 0.0);
}

TEST(MatrixDecompositions, CholeskyResumesAndReportsItsRow) {
  std::mt19937 gen(5);
  const Mat b = randomMatrix(9, 7, gen);
  Mat gram;
  multiplyLeftTranspose(b, b, gram);
  const SMat a = gram.ConvertToSmatrix();
  const UMat oneShot = CholeskyDecompWithThrow(a);
  for (int start : {0, 1, 3, 6, 7}) {
    UMat partial = SmatrixToUTmatrix(a);
    for (int i = 0; i < start; ++i)
      for (int j = i; j < 7; ++j) partial(i, j) = oneShot(i, j);
    int failed = 5;
    double residual = -1.0;
    EXPECT_EQ(CholeskyDecomp(partial, start, &failed, &residual).storage(), oneShot.storage());
    EXPECT_EQ(failed, -1);
  }
  // Indefinite at the third column: d = 1 - (0.9^2 + ...) reported as |d|.
  SMat indefinite(3, 0.0);
  indefinite(0, 0) = indefinite(1, 1) = indefinite(2, 2) = 1.0;
  indefinite(2, 0) = indefinite(2, 1) = 0.8;
  int failed = -1;
  double residual = 0.0;
  CholeskyDecomp(SmatrixToUTmatrix(indefinite), 0, &failed, &residual);
  EXPECT_EQ(failed, 2);
  EXPECT_NEAR(residual, 0.28, 1e-15);
  // A failure leaves the later columns as they came in.
  SMat wider(4, 0.5);
  wider(0, 0) = wider(1, 1) = wider(3, 3) = 1.0;
  wider(2, 2) = 0.3;
  const UMat stopped = CholeskyDecomp(SmatrixToUTmatrix(wider), 0, &failed, &residual);
  EXPECT_EQ(failed, 2);
  for (int i = 0; i < 3; ++i) EXPECT_EQ(stopped(i, 3), 0.5) << i;
  SMat result(2);
  EXPECT_FALSE(inverse(indefinite, &result));
  EXPECT_EQ(result.size(), 0);
  EXPECT_THROW(inverseWithThrow(indefinite), MatrixSingular);
  EXPECT_EQ(failureText([&] { CholeskyDecomp(UMat(3), 4, &failed, &residual); }),
            "UTmatrix: starting row greater than dimension");
  EXPECT_EQ(failureText([&] { CholeskyBackSub(oneShot, Vec(3)); }),
            "UTmatrix: matrix and vector have incompatible dimensions");
}

// A random depth-5 tree over 4 by 4 leaves of every kind, sharing subtrees.
ex::Tree randomTree(int depth, std::mt19937& gen, std::vector<ex::Tree>& pool) {
  if (depth == 0 || gen() % 5 == 0) {
    if (!pool.empty() && gen() % 3 == 0) return pool[gen() % pool.size()];
    const Mat a = randomMatrix(4, 4, gen);
    switch (gen() % 4) {
      case 0:
        return ex::M_(a);
      case 1:
        return ex::M_((a + a.transpose()).ConvertToSmatrix());
      case 2:
        return ex::M_(SmatrixToUTmatrix((a + a.transpose()).ConvertToSmatrix()));
      default:
        return ex::M_(DMat(4, a(0, 0)));
    }
  }
  const ex::Tree left = randomTree(depth - 1, gen, pool);
  ex::Tree tree;
  switch (gen() % 6) {
    case 0:
      tree = left * randomTree(depth - 1, gen, pool);
      break;
    case 1:
      tree = left + randomTree(depth - 1, gen, pool);
      break;
    case 2:
      tree = left - randomTree(depth - 1, gen, pool);
      break;
    case 3:
      tree = ex::Transpose(left);
      break;
    case 4:
      tree = ex::ZeroRow(left, static_cast<int>(gen() % 4));
      break;
    default:
      tree = ex::ZeroColumn(left, static_cast<int>(gen() % 4));
      break;
  }
  pool.push_back(tree);
  return tree;
}

TEST(MatrixExpressions, ProductsWithoutFormingTheTree) {
  std::mt19937 gen(11);
  std::vector<ex::Tree> pool;
  for (int trial = 0; trial < 40; ++trial) {
    const ex::Tree tree = randomTree(5, gen, pool);
    const Mat full = ex::Evaluate(tree);
    const Mat x = randomMatrix(4, 2, gen), y = randomMatrix(3, 4, gen);
    const double scale = 1e-13 * (1.0 + maxDifference(full, Mat(4, 4, 0.0)));
    EXPECT_LE(maxDifference(ex::MultiplyOnRight(tree, x), full * x), scale);
    EXPECT_LE(maxDifference(ex::MultiplyOnLeft(y, tree), y * full), scale);
    for (int k = 0; k < 4; ++k) {
      EXPECT_LE(maxDifference(ex::GetRow(tree, k), Mat(full.getRowVector(k), 4)), scale);
      EXPECT_LE(maxDifference(ex::GetColumn(tree, k), Mat(full.getColVector(k), 1)), scale);
    }
  }
  const ex::Tree zeroed = ex::ZeroRow(ex::M_(Mat(3, 3, 1.0)), 1);
  EXPECT_EQ(ex::GetRow(zeroed, 1).getRowVector(0), (Vec{0, 0, 0}));
  EXPECT_NE(failureText([&] {
              ex::GetColumn(zeroed, 3);
            }).find("assertion failed: (column >= 0 && column < N)"),
            std::string::npos);
  std::ostringstream text;
  text << ex::Mult(ex::M_(Mat(2, 3, 0.0)), ex::Transpose(ex::M_(Mat(4, 3, 0.0))));
  EXPECT_EQ(text.str(), "( < Matrix 2 by 3> * ( < Matrix 4 by 3> transpose ) )");
  EXPECT_EQ(ex::RowCount(ex::Transpose(ex::M_(Mat(4, 3, 0.0)))), 3);
}

}  // namespace
