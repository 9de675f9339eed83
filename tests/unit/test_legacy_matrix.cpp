// The polymorphic matrices: Cholesky factors against mpmath
// (tools/reference/gen_legacy_cholesky.py), the factor applied as a
// multivariate normal variate applies it, the failures and their words, and
// the packed layouts behind virtual access.
#include <gtest/gtest.h>
#include <qel/basic_types.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <map>
#include <stdexcept>
#include <string>
#include <vector>

#include "reference_data.h"
#include "utilities/MatrixLibrary/legacy_matrix.h"

namespace {

using Matrix = qel::matrix<double>;
using Symmetric = qel::Smatrix<double>;
using Upper = qel::UTmatrix<double>;

// Expects fn() to throw std::domain_error with exactly these words.
template <class Fn>
void expectDomainError(Fn fn, const std::string& words) {
  try {
    fn();
    ADD_FAILURE() << "no exception, expected: " << words;
  } catch (const std::domain_error& e) {
    EXPECT_EQ(std::string(e.what()), words);
  }
}

std::size_t packedSize(int n) {
  return static_cast<std::size_t>(n) * (n + 1) / 2;
}

// Largest relative error of the factors of well-conditioned matrices; the
// Hilbert matrix of order 5 (condition 4.8e5) gets its own bound.
double factorTolerance(const std::string& name) {
  return name == "hilbert5" ? 1e-11 : 4e-15;
}

TEST(LegacyMatrix, CholeskyFactorsMatchHighPrecision) {
  int factors = 0, applied = 0;
  // "apply" rows use the matrix of the "factor" row of the same name, which
  // comes first.
  std::map<std::string, std::vector<double>> inputs;
  for (const auto& row : qeltest::loadReferenceData("legacy_cholesky.csv", 2)) {
    const std::string& kind = row.text[0];
    const std::string& name = row.text[1];
    SCOPED_TRACE(name);
    const int n = static_cast<int>(row.numbers[0]);
    const double* data = row.numbers.data() + 1;
    if (kind == "factor") {
      ++factors;
      inputs[name].assign(data, data + packedSize(n));
      const Symmetric a(n, data);
      const Upper u = a.CholeskyDecomp();
      ASSERT_EQ(u.order(), n);
      const double* expected = data + packedSize(n);
      double worst = 0.0;
      for (int i = 0, k = 0; i < n; ++i) {
        for (int j = i; j < n; ++j, ++k) {
          worst = std::max(worst, qeltest::relativeError(u(i, j), expected[k]));
        }
        for (int j = 0; j < i; ++j) EXPECT_EQ(u(i, j), 0.0);
      }
      EXPECT_LE(worst, factorTolerance(name));
    } else if (kind == "apply") {
      // mean + L z with L = U', through transpose, product, sum and the cast.
      ++applied;
      const std::vector<double> z(data, data + n), mean(data + n, data + 2 * n);
      const double* expected = data + 2 * n;
      const Upper u = Symmetric(n, inputs.at(name).data()).CholeskyDecomp();
      const std::vector<double> y = u.transpose() * z + mean;
      ASSERT_EQ(y.size(), static_cast<std::size_t>(n));
      for (int i = 0; i < n; ++i) {
        EXPECT_LE(qeltest::relativeError(y[i], expected[i]), factorTolerance(name)) << i;
      }
    }
  }
  EXPECT_GE(factors, 6);
  EXPECT_EQ(applied, factors);
}

TEST(LegacyMatrix, NotPositiveDefiniteIsRefused) {
  int cases = 0;
  for (const auto& row : qeltest::loadReferenceData("legacy_cholesky.csv", 2)) {
    if (row.text[0] != "fail") continue;
    ++cases;
    SCOPED_TRACE(row.text[1]);
    const int n = static_cast<int>(row.numbers[0]);
    const Symmetric a(n, row.numbers.data() + 1);
    expectDomainError([&] { a.CholeskyDecomp(); }, "Smatrix: matrix is not positive definite");
    // The row form names the column that failed and the size of its pivot.
    int failedRow = -7;
    double residual = -1.0;
    qel::mSmatrixToUTmatrix(a).CholeskyDecomp(0, &failedRow, &residual);
    EXPECT_EQ(failedRow, row.numbers[1 + packedSize(n)]);
    EXPECT_NEAR(residual, row.numbers[2 + packedSize(n)], 1e-15);
  }
  EXPECT_GE(cases, 5);

  // Elements that are not finite are no positive definite matrix either, and
  // must not trap on the way in an armed thread.
  for (double bad :
       {std::numeric_limits<double>::quiet_NaN(), std::numeric_limits<double>::infinity()}) {
    Symmetric a(2, 1.0);
    a(0, 0) = 4.0;
    a(1, 1) = 4.0;
    a(1, 0) = bad;
    qel::SetLynFpuStates();
    expectDomainError([&] { a.CholeskyDecomp(); }, "Smatrix: matrix is not positive definite");
    qel::ResetFpuStates();
  }
}

TEST(LegacyMatrix, RowFormResumesFromAFactoredBlock) {
  // Gram matrix of (1 2 0 1; 0 1 3 1; 2 0 1 1; 1 1 1 0) plus I.
  const double lower[] = {7, 3, 7, 3, 4, 12, 3, 3, 4, 4};
  const Symmetric a(4, lower);
  const Upper full = a.CholeskyDecomp();
  for (int start = 0; start <= 4; ++start) {
    // Rows above start come from the factor, the rest from the matrix.
    Upper partial(4);
    for (int i = 0; i < 4; ++i) {
      for (int j = i; j < 4; ++j) partial(i, j) = i < start ? full(i, j) : a(i, j);
    }
    int failedRow = 99;
    double residual = 0.0;
    const Upper resumed = partial.CholeskyDecomp(start, &failedRow, &residual);
    EXPECT_EQ(failedRow, -1) << start;
    for (int i = 0; i < 4; ++i) {
      for (int j = i; j < 4; ++j) EXPECT_DOUBLE_EQ(resumed(i, j), full(i, j)) << start;
    }
  }
  expectDomainError([&] { qel::mSmatrixToUTmatrix(a).CholeskyDecomp(5, nullptr, nullptr); },
                    "UTmatrix: starting row greater than dimension");
}

TEST(LegacyMatrix, ShapeErrorsAndTheirWords) {
  Matrix twoByThree(2, 3, 1.0);
  expectDomainError([&] { twoByThree* std::vector<double>(2, 1.0); },
                    "matrix and vector multiplication: incompatible orders");
  expectDomainError([&] { static_cast<std::vector<double>>(twoByThree); },
                    "vector cast: result not a vector");
  expectDomainError([&] { twoByThree += std::vector<double>(2, 1.0); },
                    "op+= matrix and vector must be of same order");
  Matrix column(3, 1, 0.0);
  expectDomainError([&] { column += std::vector<double>(2, 1.0); },
                    "op+= matrix and vector must be of same order");
  expectDomainError([&] { twoByThree.DotProduct(0, 1, 3); },
                    "matrix::number of products greater than dimension");
  expectDomainError([&] { twoByThree.insertRow(1, std::vector<double>(2, 0.0)); },
                    "addRow\trow vector must be of same order");
  expectDomainError([&] { twoByThree.insertCol(1, std::vector<double>(3, 0.0)); },
                    "addCol column vector must be of same order");
  // A count below 1 gives 0 without touching an element (the indices here
  // name none).
  EXPECT_EQ(twoByThree.DotProduct(50, 60, 0), 0.0);
  EXPECT_EQ(twoByThree.DotProduct(50, 60, -3), 0.0);
  // A one-column matrix converts.
  column(2, 0) = 5.0;
  EXPECT_EQ(static_cast<std::vector<double>>(column), (std::vector<double>{0.0, 0.0, 5.0}));
}

Matrix numbered(int rows, int cols) {
  Matrix m(rows, cols);
  for (int i = 0; i < rows; ++i) {
    for (int j = 0; j < cols; ++j) m(i, j) = 10.0 * i + j;
  }
  return m;
}

std::vector<double> elements(const Matrix& m) {
  std::vector<double> out;
  for (int i = 0; i < m.rowCount(); ++i) {
    for (int j = 0; j < m.colCount(); ++j) out.push_back(m(i, j));
  }
  return out;
}

TEST(LegacyMatrix, ProductsTransposeAndEditing) {
  const Matrix m = numbered(2, 3);  // 0 1 2 / 10 11 12
  const std::vector<double> y = m * std::vector<double>{1.0, -2.0, 0.5};
  EXPECT_EQ(y, (std::vector<double>{-1.0, -6.0}));
  const Matrix t = m.transpose();
  ASSERT_EQ(t.rowCount(), 3);
  ASSERT_EQ(t.colCount(), 2);
  EXPECT_EQ(elements(t), (std::vector<double>{0, 10, 1, 11, 2, 12}));

  const Matrix withoutRow = m.delRow(0), withoutCol = m.delCol(1);
  EXPECT_EQ(elements(withoutRow), (std::vector<double>{10, 11, 12}));
  EXPECT_EQ(elements(withoutCol), (std::vector<double>{0, 2, 10, 12}));
  EXPECT_EQ(elements(m), (std::vector<double>{0, 1, 2, 10, 11, 12}));

  Matrix edit = numbered(3, 3);
  edit.removeRow(1).removeCol(0);
  EXPECT_EQ(elements(edit), (std::vector<double>{1, 2, 21, 22}));
  edit.insertRow(1, 7.0).insertCol(2, std::vector<double>{-1, -2, -3});
  EXPECT_EQ(elements(edit), (std::vector<double>{1, 2, -1, 7, 7, -2, 21, 22, -3}));
  edit.insertCol(0, 0.5).insertRow(3, std::vector<double>{9, 9, 9, 9});
  EXPECT_EQ(elements(edit),
            (std::vector<double>{0.5, 1, 2, -1, 0.5, 7, 7, -2, 0.5, 21, 22, -3, 9, 9, 9, 9}));
  // Indices that name no row or column change nothing.
  edit.removeRow(4).removeCol(-1).insertRow(6, 1.0);
  EXPECT_EQ(edit.rowCount(), 4);
  EXPECT_EQ(edit.colCount(), 4);

  // Assignment: same shape copies, another shape reallocates.
  Matrix target(2, 3, 0.0);
  target = m;
  EXPECT_EQ(elements(target), elements(m));
  target = numbered(1, 4);
  EXPECT_EQ(target.rowCount(), 1);
  EXPECT_EQ(elements(target), (std::vector<double>{0, 1, 2, 3}));
  target.initialize(2, 2);
  EXPECT_EQ(elements(target), (std::vector<double>(4, 0.0)));
}

TEST(LegacyMatrix, PackedLayoutsBehindVirtualAccess) {
  Symmetric s(6, 0.0);
  s(2, 5) = 3.5;
  EXPECT_EQ(s(5, 2), 3.5);
  EXPECT_EQ(&s(5, 2), &s(2, 5));

  // Editing a symmetric matrix does nothing, also through the base class.
  Matrix& asMatrix = s;
  asMatrix.insertRow(0, 1.0).insertRow(0, std::vector<double>(17, 1.0));
  asMatrix.insertCol(1, 1.0).removeRow(0).removeCol(3);
  EXPECT_EQ(s.order(), 6);
  EXPECT_EQ(s.rowCount(), 6);
  EXPECT_EQ(s(5, 2), 3.5);
  // delRow is generic: the full form without that row.
  const Matrix rest = asMatrix.delRow(2);
  EXPECT_EQ(rest.rowCount(), 5);
  EXPECT_EQ(rest(4, 2), 3.5);  // old row 5
  EXPECT_EQ(rest(1, 5), 0.0);  // old row 1
  EXPECT_EQ(rest(2, 2), 0.0);  // old row 3

  Upper u(3, 0.0);
  for (int i = 0; i < 3; ++i) {
    for (int j = i; j < 3; ++j) u(i, j) = 1.0 + i * 3 + j;
  }
  u(2, 0) = 99.0;  // below the diagonal: lost
  const Upper& constU = u;
  EXPECT_EQ(constU(2, 0), 0.0);
  EXPECT_EQ(u(2, 0), 0.0);
  // Generic copy and transpose read the layout through access.
  const Matrix full(u);
  EXPECT_EQ(elements(full), (std::vector<double>{1, 2, 3, 0, 5, 6, 0, 0, 9}));
  EXPECT_EQ(elements(u.transpose()), (std::vector<double>{1, 0, 0, 2, 5, 0, 3, 6, 9}));
  EXPECT_EQ(u.DotProduct(1, 2, 2), 2.0 * 3.0 + 5.0 * 6.0);
  // Packed copies keep their layout.
  Upper copy(2);
  copy = u;
  EXPECT_EQ(copy.order(), 3);
  EXPECT_EQ(copy(1, 2), 6.0);
  const Symmetric sCopy(s);
  EXPECT_EQ(sCopy(5, 2), 3.5);
  // The upper triangle of a symmetric matrix.
  const Upper fromS = qel::mSmatrixToUTmatrix(s);
  EXPECT_EQ(fromS(2, 5), 3.5);
  EXPECT_EQ(fromS(5, 2), 0.0);
}

}  // namespace
