// The passes over the rows of a column-held design that the Householder
// reduction needs, blocked by rows so that a block of every column stays in
// the first-level cache, with four partial sums in each inner product (a
// shorter chain of additions, and a two-level summation over the blocks
// whose error grows with the block length plus the number of blocks rather
// than with n).
#ifndef QEL_INTERFACES_LINEAR_MODELLING_HOUSEHOLDER_SUMS_H
#define QEL_INTERFACES_LINEAR_MODELLING_HOUSEHOLDER_SUMS_H

#include <cstddef>
#include <vector>

namespace qel {
namespace v1 {
namespace experimental {

// Sum of a[i] b[i] and sum of a[i]^2, i < length.
double dotProduct(double const* a, double const* b, std::size_t length);
double squaredNorm(double const* a, std::size_t length);

// What the reflection of column q at pivot row p needs: the sum of squares
// of the column below the pivot row (tail) and its inner products with the
// columns on its right below the pivot row (dots[k], k > q).
struct ColumnSums {
  double tail = 0.0;
  std::vector<double> dots;
};

// The sums of column q at pivot row p, by a pass over the rows.
ColumnSums tailSums(double const* const* design, unsigned q, unsigned columns, std::size_t p,
                    std::size_t n);

// norm2[k] = the sum of squares of every column, and the sums of column 0
// at pivot row 0, in one pass.
ColumnSums initialSums(double const* const* design, unsigned columns, std::size_t n, double* norm2);

// Applies the reflection of column q at pivot row p, whose vector is v0 at
// row p and design[q][i] below it, to the columns k > q:
// column_k -= alpha[k] v over rows p..n-1, alpha[k] = beta v'column_k. In
// the same pass, returns the sums of column q + 1 at pivot row p + 1.
ColumnSums applyReflection(double** design, unsigned q, unsigned columns, std::size_t p,
                           std::size_t n, double v0, double const* alpha);

}  // namespace experimental
}  // namespace v1
}  // namespace qel

#endif
