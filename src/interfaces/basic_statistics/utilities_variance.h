// Steps shared by the one- and two-variance intervals and tests.
#ifndef QEL_SRC_INTERFACES_BASIC_STATISTICS_UTILITIES_VARIANCE_H
#define QEL_SRC_INTERFACES_BASIC_STATISTICS_UTILITIES_VARIANCE_H

#include <qel/basic_types.h>
#include <qel/variance_tests.h>

namespace qel {
namespace v0 {

// Chi-square limits of a variance on df degrees of freedom; 0 or 30002.
int PerformChiSquareMethod(double* lower, double* upper, double variance, double df,
                           double confidence, IntervalType type);

// Bonett's limits of a variance. *varianceThenKurtosis holds the sample
// variance on entry and the kurtosis estimate on return (1 for a variance
// not above 0). Limits NaN when the kurtosis term or the quantile leave no
// interval. 0, 30001 or 30002.
int PerformBonettMethod(double* lower, double* upper, double* varianceThenKurtosis,
                        double confidence, double const* x, unsigned int n, IntervalType type);

// Bonett's one-sample method on each sample of the record, for the two
// kurtosis estimates; the one-sample limits are not kept.
int PerformBonettMethodForEach(TwoVariance* record, double const* x, double const* y,
                               double confidence, IntervalType type, double* firstKurtosis,
                               double* secondKurtosis);

// Bonett's limits and test of the ratio sigma1/sigma2 in the record.
int PerformBonettMethod(TwoVariance* record, double const* x, double const* y, double confidence,
                        IntervalType type, AlternativeHypothesis alternative, double ratio0);

// F limits of sigma1/sigma2, the F statistic and its P-value; 0 or 30002.
int PerformFMethod(TwoVariance* record, double confidence, IntervalType type,
                   AlternativeHypothesis alternative, double ratio0);

// Reorders x and y in place and replaces each value by its absolute deviation
// from its sample's median (the type 6 quantile at 0.5); one parallel
// section a sample.
void CalcAbsMedianDeviations(double* x, unsigned int n1, double* y, unsigned int n2);

// The t test of mean |x - median| = ratio0 * mean |y - median| on pooled
// variances and Fieller's interval for the ratio of the two means; the
// moments of the two samples in one parallel section each. 0 or 30002.
int PerformLeveneMethod(TwoVariance* record, double const* dx, double const* dy, double confidence,
                        IntervalType type, AlternativeHypothesis alternative, double ratio0);

// The exported chi-square and F functions with NaN for a NaN argument,
// which those functions do not check before they arm the frame.
double ChiSqQuantile(double p, double df);
double FQuantile(double p, double df1, double df2);
double ChiSqTailPValue(double x, double df, AlternativeHypothesis alternative);
double FTailPValue(double x, double df1, double df2, AlternativeHypothesis alternative);

bool IsKnownAlternative(AlternativeHypothesis alternative);
bool IsKnownIntervalType(IntervalType type);

}  // namespace v0
}  // namespace qel

#endif
