// Layer v0 of the distribution functions, for the test interface: a few
// functions that check their arguments for NaN and infinity first and then
// run the armed frame around the same kernels as the exported functions.
#ifndef QEL_SRC_INTERFACES_MATH_RANDOM_DISTRIBUTIONS_V0_H
#define QEL_SRC_INTERFACES_MATH_RANDOM_DISTRIBUTIONS_V0_H

#include <qel/basic_types.h>
#include <qel/interval.h>

namespace qel {
namespace v0 {

double NormalInvCdf(double p, double mean, double sigma);
double TInvCdf(double p, double df, double noncentrality);
double NormalPValue(double z, AlternativeHypothesis alternative);
double TPValue(double t, double df, AlternativeHypothesis alternative);
// Positive for both one-sided alternatives.
double NormalCritValue(double alpha, AlternativeHypothesis alternative);
double TCritValue(double alpha, double df, AlternativeHypothesis alternative);
double BinomialPValue(double x, unsigned n, double p, AlternativeHypothesis alternative);

}  // namespace v0
}  // namespace qel

#endif
