/// \file
/// Polynomial least squares for the fitted line of a graph: y on 1, x, x^2,
/// ..., x^degree (or without the constant term), solved by Householder
/// reflections on the design held by columns (Golub and Van Loan, Matrix
/// Computations, 4th ed., algorithms 5.1.1 and 5.2.1).
#ifndef QEL_CURVE_FIT_H
#define QEL_CURVE_FIT_H

#include <qel/basic_types.h>
#include <qel/export.h>

namespace qel {
namespace v1 {

/// Least-squares polynomial of the given degree through the points (x[i],
/// y[i]), i < n.
///
/// coefficients: degree + 2 doubles. [0] is the intercept (0 when intercept
/// is false), [1..degree] the coefficients of x^1..x^degree, and
/// [degree + 1] the residual standard deviation sqrt(RSS / (n - rank)),
/// where rank counts the terms that were fitted (NaN when n equals the rank).
///
/// fitStatistic: R^2 as R's summary.lm reports it: with the intercept,
/// 1 - RSS / sum (y - mean y)^2; without it, 1 - RSS / sum y^2 (uncentred).
/// It is computed as SSR / (SSR + RSS) from the rotated response, so it lies
/// in [0, 1]; NaN when the denominator is 0 (y constant with the intercept,
/// or all y zero).
///
/// tolerance: a term's column fails, and gets the coefficient NaN, when the
/// diagonal element |R_jj| of its reflection is at most tolerance times the
/// column's Euclidean norm before any reduction (a scale-free test of
/// collinearity with the terms before it). The failed column is left out and
/// the fit goes on with the others. A tolerance <= 0 (or NaN) means 1e-12.
///
/// Returns 0; 30019 when every term fails, when there is no term (degree 0
/// without the intercept), when n is 0, or when x, y or a power of x is not
/// finite; 30001 when memory runs out. On a nonzero code all degree + 2
/// coefficients and the fit statistic are NaN. With n <= degree the trailing
/// terms fail and get NaN, as in R's lm.
QEL_API int RunLynGrCurveFit(double* coefficients, double* fitStatistic, double const* x,
                             double const* y, unsigned n, unsigned degree, double tolerance,
                             bool intercept);

}  // namespace v1
}  // namespace qel

#endif
