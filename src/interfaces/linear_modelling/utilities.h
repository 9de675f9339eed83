// Householder least squares on an augmented design held by columns: the
// kernels of the polynomial curve fit and of the one-way regression of
// Levene's test. A design is an array of column pointers; the response is
// the last column.
#ifndef QEL_INTERFACES_LINEAR_MODELLING_UTILITIES_H
#define QEL_INTERFACES_LINEAR_MODELLING_UTILITIES_H

#include <qel/curve_fit.h>

namespace qel {
namespace v1 {
namespace experimental {

// Number of columns of the polynomial design: the constant column (with the
// intercept), x^1..x^degree and the response.
inline unsigned CurveFitDesignColumns(unsigned degree, bool intercept) {
  return degree + (intercept ? 2u : 1u);
}

// The least-squares fit of the last column of design (n rows, columns as
// CurveFitDesignColumns) on the others, with the outputs of
// qel::v1::RunLynGrCurveFit. The design is overwritten: the columns hold
// the reflection vectors and the rotated response on return.
int RunLynGrCurveFit(double* coefficients, double* fitStatistic, double** design, unsigned n,
                     unsigned degree, double tolerance, bool intercept);

// The augmented polynomial design of x and y: with the intercept a column
// of 1 first, then x, x^2, ..., x^degree, then a copy of y. The power
// columns are filled in a parallel region (static schedule), the constant
// column and the copies by one thread of it. Returns null with *status
// 30001 when memory runs out, else *status 0. Free with
// DeleteAugmentedDesignMatrix(&design, CurveFitDesignColumns(degree,
// intercept)).
double** MakeNAryAugmentedDesignMatrix(double const* x, double const* y, unsigned n,
                                       unsigned degree, int* status, bool intercept);

// Frees a design of the given number of columns and sets *design to null.
// A null design is accepted.
void DeleteAugmentedDesignMatrix(double*** design, unsigned columns);

// The one-way design of groups of the given sizes, N = the sum of the sizes
// rows and groups + 1 columns: column 0 all 1, column j (1 <= j < groups)
// the indicator of group j (the rows of group 0 come first, then group 1,
// ...), and a response column of zeros for the caller to fill. Returns null
// with *status 30001 when memory runs out, else *status 0.
double** MakeDesignMatrix(unsigned const* groupSizes, unsigned groups, int* status);

// Turns v[0..length-1] into the Householder vector of a reflection
// H = I - beta v v' that maps the original v onto r e_1, and returns r, the
// new diagonal element (r = ||v|| >= 0). v[1..] are kept; v[0] becomes
// v[0] - r, computed as -s / (v[0] + r) for positive v[0] to avoid
// cancellation (Parlett 1971), where s is the sum of squares of v[1..]. When
// length is 1 or v[1..] are 0 the reflection is the identity: beta = 0 and
// the return value is v[0] itself. When the squares would overflow or
// underflow, the whole of v is first scaled by a power of 2 (which leaves
// the reflection the same). Infinite or NaN elements give NaN and beta NaN.
double GenerateHouseholderVector(double* v, unsigned length, double* beta);

// Applies the reflection (v, beta) to column: column -= v (beta v'column).
void HouseholderTransform(double* column, double const* v, double beta, unsigned length);

// Back substitution for R solution = rightSide, R upper triangular of the
// given order packed by columns: element (i, j), i <= j, at j (j + 1) / 2 + i.
// The diagonal must be nonzero.
void SolveUpperTriangularSystem(double* solution, double const* packedUpper, unsigned order,
                                double const* rightSide);

// Sets the degree + 2 coefficients and the fit statistic to NaN.
void SetToNonAnswerResult(double* coefficients, double* fitStatistic, unsigned degree);

}  // namespace experimental
}  // namespace v1
}  // namespace qel

#endif
