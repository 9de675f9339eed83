/// \file
/// Tick marks and extent of a graph axis for a data range: a search over
/// candidate increments and first ticks made of nice numbers, every allowed
/// tick count, scored by a weighted sum of penalties whose weights are orders
/// of magnitude apart (in decreasing weight: a scale past its allowed maximum,
/// a missing zero tick on data that straddle zero, a first tick off the
/// multiples of the increment, ugly numbers and tick counts, the fit to the
/// data). The interface is kept for old callers; the rules are fixed.
///
/// Arguments:
///  - minTicks, maxTicks: the allowed tick counts.
///  - belowMinMargin <= belowMaxMargin, aboveMinMargin <= aboveMaxMargin:
///    how far the scale must and may extend below and above the data, as
///    fractions of the data range.
///  - lowerLimit, upperLimit: absolute limits on the ticks; +-DBL_MAX and
///    +-infinity (the values 1.79769313486232e+308 of old callers parse to
///    infinity) mean no limit.
///  - lowTickMargin, highTickMargin: room beyond the end ticks, in units of
///    the increment.
///
/// Rulings beyond the fixed rules:
///  - The scale always covers the data [dataMin, dataMax]: where the decimal
///    truncation of the scale ends would cut into the scale (a scale maximum
///    of 74.67 computed as 74.669999...), the end is rounded outward instead,
///    a value within 1e-9 of a unit of the last kept digit counting as that
///    unit; after denormalising, the scale ends are widened to the data and
///    to the end ticks where rounding of the last bit would leave them short.
///  - All data equal with both maximum range margins 0 (no widening
///    allowed): first = last = scale minimum = scale maximum = the value,
///    increment 0, count 1.
///  - Data below 1e-12 in magnitude that are not all equal keep their own
///    range instead of becoming -0.5 .. 0.5 (which would show them as one
///    point); all-zero (or all-equal tiny) data still get -0.5 .. 0.5.
///  - When no candidate passes, the plain scale dataMin .. dataMax with
///    minTicks ticks is the answer.
///  - Bad input gives a defined result: NaN or infinite data leave the result
///    as its constructor made it (five NaN, count 0); dataMin above dataMax,
///    a minimum margin above its maximum margin and lowerLimit above
///    upperLimit are swapped; negative or NaN margins count as 0; a NaN limit
///    or a limit that excludes the whole data range counts as no limit;
///    minTicks is raised to at least 2 (the largest increment divides by
///    minTicks - 1), maxTicks is raised to minTicks, and both are capped at
///    1000, which bounds the time of a call.
#ifndef QEL_AXIS_TICKS_H
#define QEL_AXIS_TICKS_H

#include <qel/export.h>

namespace qel {
namespace deprecated {

/// The ticks and extent of one axis, filled by ComputeTicks.
struct TickCalculationResult {
  /// The five doubles NaN, the count 0.
  QEL_API TickCalculationResult();
  double firstTick;     ///< value of the first tick
  double lastTick;      ///< value of the last tick
  double scaleMinimum;  ///< lower end of the axis
  double scaleMaximum;  ///< upper end of the axis
  double increment;     ///< distance between ticks
  int tickCount;        ///< number of ticks
};

/// Finds the ticks and the extent of the axis for the data range
/// [dataMin, dataMax] under the arguments described in the file description,
/// and writes them to *result. Bad input gives the defined results listed
/// there; nothing is reported.
QEL_API void ComputeTicks(TickCalculationResult* result, int minTicks, int maxTicks,
                          double belowMinMargin, double belowMaxMargin, double aboveMinMargin,
                          double aboveMaxMargin, double lowerLimit, double upperLimit,
                          double lowTickMargin, double highTickMargin, double dataMin,
                          double dataMax);

}  // namespace deprecated
}  // namespace qel

#endif
