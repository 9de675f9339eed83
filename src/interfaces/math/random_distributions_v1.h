// Layer v1 of the distribution functions, for the test interface. Bare
// frame: these functions never touch the floating-point state, reach the ELV
// routines (or compute a direct formula), answer NaN where no value exists
// (never the missing value) and take unsigned counts.
#ifndef QEL_SRC_INTERFACES_MATH_RANDOM_DISTRIBUTIONS_V1_H
#define QEL_SRC_INTERFACES_MATH_RANDOM_DISTRIBUTIONS_V1_H

#include <qel/basic_types.h>

namespace qel {
namespace v1 {

double NormalCdf(double x, double mean, double sigma, bool upperTail);
double NormalInvCdf(double p, double mean, double sigma);
// P-values: -1 the lower tail, 1 the upper, 0 twice the smaller; -2.0 for an
// alternative outside these.
double NormalPValue(double z, AlternativeHypothesis alternative);
double ChiSqPValue(double x, double df, AlternativeHypothesis alternative);

double BetaPdf(double x, double a, double b);
double BetaCdf(double x, double a, double b, bool upperTail);
double BetaInvCdf(double p, double a, double b);

// The upper tails of the discrete laws include the point: P(X >= x).
double BinomialPdf(double x, unsigned n, double p);
double BinomialCdf(double x, unsigned n, double p, bool upperTail);
double BinomialInvCdf(double p, unsigned n, double prob);

double HypergeometricPdf(double x, unsigned N, unsigned M, unsigned n);
double HypergeometricCdf(double x, unsigned N, unsigned M, unsigned n, bool upperTail);
double HypergeometricInvCdf(double p, unsigned N, unsigned M, unsigned n);
// Fisher's exact test for a two-sided alternative; NaN for an unknown one.
double HypergeometricPValue(unsigned x, unsigned N, unsigned M, unsigned n,
                            AlternativeHypothesis alternative);

// Plus infinity at p = 1, where the kernel has no answer.
double WeibullInvCdf(double p, double shape, double scale, double threshold);

// Array forms: the scalar logic element by element.
void NormalCdf(double* out, const double* x, unsigned count, double mean, double sigma,
               bool upperTail);
void NormalInvCdf(double* out, const double* p, unsigned count, double mean, double sigma);
void BetaPdf(double* out, const double* x, unsigned count, double a, double b);
void BetaCdf(double* out, const double* x, unsigned count, double a, double b, bool upperTail);
void BetaInvCdf(double* out, const double* p, unsigned count, double a, double b);
void BinomialPdf(double* out, const double* x, unsigned count, unsigned n, double p);
void BinomialCdf(double* out, const double* x, unsigned count, unsigned n, double p,
                 bool upperTail);
void BinomialInvCdf(double* out, const double* p, unsigned count, unsigned n, double prob);
void HypergeometricPdf(double* out, const double* x, unsigned count, unsigned N, unsigned M,
                       unsigned n);
void HypergeometricCdf(double* out, const double* x, unsigned count, unsigned N, unsigned M,
                       unsigned n, bool upperTail);
void HypergeometricInvCdf(double* out, const double* p, unsigned count, unsigned N, unsigned M,
                          unsigned n);
void WeibullInvCdf(double* out, const double* p, unsigned count, double shape, double scale,
                   double threshold);

// The two halves of HypergeometricInvCdf: the degenerate tables (true when
// *result holds the answer), and the quantile search proper.
bool HypergeometricInvCdfHelpFailed(unsigned N, unsigned M, unsigned n, double* result);
double HypergeometricInvCdfHelpLoop(double p, unsigned N, unsigned M, unsigned n);

}  // namespace v1
}  // namespace qel

#endif
