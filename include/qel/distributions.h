// Exported distribution functions. Each family has a density (or mass), a
// cumulative probability and an inverse, on one number and on an array.
//
// Scalar forms answer NaN when no value exists. Every ...Cdf takes a final
// upperTail flag: false gives P(X <= x), true gives P(X > x) computed as a tail
// of its own, so that a tiny upper tail keeps its relative accuracy.
//
// Array forms: output first, input second, count third, then the parameters of
// the scalar form. out may equal the input array.
#ifndef QEL_DISTRIBUTIONS_H
#define QEL_DISTRIBUTIONS_H

#include <qel/basic_types.h>

namespace qel {

// Cauchy(location, scale)
QEL_API double CauchyPdf(double x, double location, double scale);
QEL_API double CauchyCdf(double x, double location, double scale, bool upperTail);
QEL_API double CauchyInvCdf(double p, double location, double scale);
QEL_API void CauchyPdf(double* out, const double* x, unsigned long count, double location,
                       double scale);
QEL_API void CauchyCdf(double* out, const double* x, unsigned long count, double location,
                       double scale, bool upperTail);
QEL_API void CauchyInvCdf(double* out, const double* p, unsigned long count, double location,
                          double scale);

// Logistic(location, scale)
QEL_API double LogisticPdf(double x, double location, double scale);
QEL_API double LogisticCdf(double x, double location, double scale, bool upperTail);
QEL_API double LogisticInvCdf(double p, double location, double scale);
QEL_API void LogisticPdf(double* out, const double* x, unsigned long count, double location,
                         double scale);
QEL_API void LogisticCdf(double* out, const double* x, unsigned long count, double location,
                         double scale, bool upperTail);
QEL_API void LogisticInvCdf(double* out, const double* p, unsigned long count, double location,
                            double scale);

// LogLogistic(location, scale, threshold): log(X - threshold) is logistic.
QEL_API double LogLogisticPdf(double x, double location, double scale, double threshold);
QEL_API double LogLogisticCdf(double x, double location, double scale, double threshold,
                              bool upperTail);
QEL_API double LogLogisticInvCdf(double p, double location, double scale, double threshold);
QEL_API void LogLogisticPdf(double* out, const double* x, unsigned long count, double location,
                            double scale, double threshold);
QEL_API void LogLogisticCdf(double* out, const double* x, unsigned long count, double location,
                            double scale, double threshold, bool upperTail);
QEL_API void LogLogisticInvCdf(double* out, const double* p, unsigned long count, double location,
                               double scale, double threshold);

// Triangular(lower, mode, upper)
QEL_API double TriangularPdf(double x, double lower, double mode, double upper);
QEL_API double TriangularCdf(double x, double lower, double mode, double upper, bool upperTail);
QEL_API double TriangularInvCdf(double p, double lower, double mode, double upper);
QEL_API void TriangularPdf(double* out, const double* x, unsigned long count, double lower,
                           double mode, double upper);
QEL_API void TriangularCdf(double* out, const double* x, unsigned long count, double lower,
                           double mode, double upper, bool upperTail);
QEL_API void TriangularInvCdf(double* out, const double* p, unsigned long count, double lower,
                              double mode, double upper);

// Uniform(lower, upper). Bare frame: no floating-point state change, no
// parameter check (lower == upper divides by zero and gives infinity).
QEL_API double UniformPdf(double x, double lower, double upper);
QEL_API double UniformCdf(double x, double lower, double upper, bool upperTail);
QEL_API double UniformInvCdf(double p, double lower, double upper);
QEL_API void UniformPdf(double* out, const double* x, unsigned long count, double lower,
                        double upper);
QEL_API void UniformCdf(double* out, const double* x, unsigned long count, double lower,
                        double upper, bool upperTail);
QEL_API void UniformInvCdf(double* out, const double* p, unsigned long count, double lower,
                           double upper);

}  // namespace qel

#endif
