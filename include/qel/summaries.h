/// \file
/// Ready-made groupings of the descriptive statistics for displays: the
/// five-number summary, the extended summary (moments, five numbers and
/// modes in one pass over a sorted copy) and the numbers a boxplot draws.
///
/// The caller's data are never changed; no element is tested for NaN or for
/// the missing value. The floating-point state is not switched. Message
/// codes: 0, 30001 (out of memory), 30017 (from the quantile layer).
#ifndef QEL_SUMMARIES_H
#define QEL_SUMMARIES_H

#include <qel/descriptive.h>
#include <qel/export.h>

namespace qel {
namespace v1 {

/// Minimum, quartiles, median and maximum; all NaN from the constructor.
struct FiveNumberSummary {
  /// All fields NaN.
  QEL_API FiveNumberSummary();
  double minimum;        ///< smallest value
  double firstQuartile;  ///< type-6 quantile at 0.25
  double median;         ///< type-6 quantile at 0.5
  double thirdQuartile;  ///< type-6 quantile at 0.75
  double maximum;        ///< largest value
};

/// What a boxplot needs; all NaN from the constructor. The quartiles and the
/// median are sample quantiles of type 6 (Hyndman and Fan 1996); the hinges
/// sit at depth (n+3)/4 from either end; the limits are a confidence
/// interval of the median from the sign test.
struct LynBoxplotHelper {
  /// All fields NaN.
  QEL_API LynBoxplotHelper();
  double minimum;            ///< smallest value
  double maximum;            ///< largest value
  double firstQuartile;      ///< type-6 quantile at 0.25
  double median;             ///< type-6 quantile at 0.5
  double thirdQuartile;      ///< type-6 quantile at 0.75
  double medianLowerLimit;   ///< lower limit of the median's sign-test interval (the notch)
  double medianUpperLimit;   ///< upper limit of the median's sign-test interval (the notch)
  double lowerHinge;         ///< order statistic at depth (n+3)/4 from the bottom
  double upperHinge;         ///< order statistic at depth (n+3)/4 from the top
  double mean;               ///< sample mean
  double standardDeviation;  ///< sample standard deviation (denominator n - 1)
};

/// Type-6 quantiles at 0, 0.25, 0.5, 0.75 and 1. Answers the code of
/// GetSampleQuantiles; the record is written only on 0 (n = 0 writes NaN).
QEL_API int GetLynFiveNumberSummary(FiveNumberSummary* five, double const* x, unsigned int n);

/// The second moments of the moments->n values of x, their five numbers and
/// up to five modes (modes must have room for five; *modeCount gets the
/// number stored, *frequency their frequency). Returns 0, or 30001 with the
/// five numbers and the modes reset to NaN.
QEL_API int GetLyn2013ExtendedSummary(SecondSampleMoments* moments, FiveNumberSummary* five,
                                      double* modes, unsigned int* modeCount,
                                      unsigned int* frequency, double const* x);

/// Fills the boxplot record; the interval of the median is exact (binomial)
/// up to n = 50 and from the normal approximation above. The confidence is
/// not checked. Returns 0, or 30001 with every field NaN.
QEL_API int RunLynBoxplotHelper(LynBoxplotHelper* box, double confidence, double const* x,
                                unsigned int n);

}  // namespace v1
}  // namespace qel

#endif
