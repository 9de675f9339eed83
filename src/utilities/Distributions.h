// Distribution kernels: m<Family>Pdf, m<Family>Cdf and m<Family>InvCdf.
//
// Kernels work in double precision, return the missing value when they have no
// answer and never touch the floating-point state. They check no parameters;
// validity is the business of the distribution classes. A kernel catches
// std::runtime_error (a trapped overflow or division by zero, or the "float
// overflow" of the checked functions) only where its family says so.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_H

namespace qel {

// Closed-form families.
double mUniformPdf(double x, double lower, double upper);
double mUniformCdf(double x, double lower, double upper, bool upperTail);
double mUniformInvCdf(double p, double lower, double upper);

double mTriangularPdf(double x, double lower, double mode, double upper);
double mTriangularCdf(double x, double lower, double mode, double upper, bool upperTail);
double mTriangularInvCdf(double p, double lower, double mode, double upper);

double mLogisticPdf(double x, double location, double scale);
double mLogisticCdf(double x, double location, double scale, bool upperTail);
double mLogisticInvCdf(double p, double location, double scale);

double mLogLogisticPdf(double x, double location, double scale, double threshold);
double mLogLogisticCdf(double x, double location, double scale, double threshold, bool upperTail);
double mLogLogisticInvCdf(double p, double location, double scale, double threshold);

double mCauchyPdf(double x, double location, double scale);
double mCauchyCdf(double x, double location, double scale, bool upperTail);
double mCauchyInvCdf(double p, double location, double scale);

}  // namespace qel

#endif
