/// \file
/// Symmetric confidence intervals around an estimate, the shared helper of the
/// location tests, with the two quantile function objects it is instantiated
/// for.
///
/// MakeTraditionalSymmetricCI sets the limits estimate -/+ standardError * q,
/// with q the quantile of the statistic's law given by inverseCdf: for a
/// two-sided interval q = inverseCdf((1 + confidence) / 2); a one-sided
/// interval puts the whole confidence level in its one tail,
/// q = inverseCdf(confidence), and leaves the other limit infinite (+inf for
/// kIntervalLowerBound, -inf for kIntervalUpperBound). It returns 0 (whatever
/// NaN the quantile carries into the limits), or 30002 with both limits NaN
/// for a type outside -1, 0, 1. Instances exist for the two function objects
/// below only.
#ifndef QEL_INTERVAL_H
#define QEL_INTERVAL_H

#include <qel/basic_types.h>
#include <qel/export.h>

namespace qel {
namespace v0 {

/// Standard normal quantile: NaN for a NaN or infinite p.
struct NormalInvCdfFunc {
  /// The z with P(Z <= z) = p.
  QEL_API double operator()(double p) const;
};

/// Central t quantile on df degrees of freedom: NaN for a NaN or infinite p
/// or df.
class TInvCdfFunc {
 public:
  /// The law on df degrees of freedom.
  explicit TInvCdfFunc(double df) : mDf(df) {}
  /// The t with P(T <= t) = p.
  QEL_API double operator()(double p) const;

 private:
  double mDf;
};

}  // namespace v0

namespace v1 {

/// The interval estimate -/+ standardError * q of the given confidence and
/// side, q from the quantile function object (see the file description).
/// \param inverseCdf the quantile of the statistic's law: NormalInvCdfFunc or
///        TInvCdfFunc (the only instances).
/// \param confidence the level, a fraction in (0, 1).
/// \param type the side of the interval.
/// \param estimate the centre of the interval.
/// \param standardError the scale of the half-width.
/// \param[out] lower the lower limit (-inf for kIntervalUpperBound).
/// \param[out] upper the upper limit (+inf for kIntervalLowerBound).
/// \return 0, or 30002 (qelFailBadEnumValue) with both limits NaN for a type
///         outside -1, 0, 1.
template <class F>
QEL_API int MakeTraditionalSymmetricCI(F const& inverseCdf, double confidence, IntervalType type,
                                       double estimate, double standardError, double* lower,
                                       double* upper);

/// The instance on the standard normal quantile (z intervals).
extern template QEL_API int MakeTraditionalSymmetricCI<v0::NormalInvCdfFunc>(
    v0::NormalInvCdfFunc const&, double, IntervalType, double, double, double*, double*);
/// The instance on the central t quantile (t intervals).
extern template QEL_API int MakeTraditionalSymmetricCI<v0::TInvCdfFunc>(v0::TInvCdfFunc const&,
                                                                        double, IntervalType,
                                                                        double, double, double*,
                                                                        double*);

}  // namespace v1
}  // namespace qel

#endif
