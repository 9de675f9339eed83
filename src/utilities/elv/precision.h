// Precision setting of the high-accuracy (ELV) routines.
//
// Three tolerances decide how far the routines carry their work: the term
// cut-off of the scaled series (terms start at 1, so the cut-off is relative
// to the sum), the relative step limit of the Newton iterations and of the
// continued fractions, and the stop limit of the Poisson-mixture sums (tail
// weight left out at the start index and relative size of the rest of the
// sum). By default all three sit at double precision, so that every routine
// answers to the last few units of the 53-bit mantissa. The historical
// setting (cut-off and step limit 1e-9, mixture stop 5e-10) stays reachable
// for callers that rely on its exact iteration counts.
#ifndef QEL_SRC_UTILITIES_ELV_PRECISION_H
#define QEL_SRC_UTILITIES_ELV_PRECISION_H

#include <atomic>

namespace qel {
namespace elv {

enum class ElvPrecision {
  Full,        // double precision (the default)
  Historical,  // cut-off 1e-9, mixture stop 5e-10
};

struct ElvTolerances {
  double seriesCutoff;  // smallest term of a scaled series that is added
  double stepLimit;     // relative step limit of the Newton iterations
  double fractionGap;   // relative gap of continued-fraction convergents
  double mixtureStop;   // tail weight and relative rest of a mixture sum
};

// Full: a series stops once its term falls below 2^-56 of the leading 1, so
// the dropped rest is far below one unit in the last place. Newton and the
// continued fractions stop at a relative step of 1e-13 / gap of 2e-15: the
// quadratic convergence of Newton puts the applied last step's error near
// 1e-26, and a continued-fraction midpoint is off by half the gap, while the
// rounding noise of a tail (a few units of 1e-16) can never stall either.
inline constexpr ElvTolerances kFullTolerances = {1.4e-17, 1e-13, 2e-15, 1e-17};
inline constexpr ElvTolerances kHistoricalTolerances = {1e-9, 1e-9, 1e-9, 5e-10};

// Process-wide; a change applies to the runs that start after it. Read
// inline (a relaxed load and a select): the series ask for their cut-off on
// every term.
inline std::atomic<int> currentElvPrecision{static_cast<int>(ElvPrecision::Full)};

inline void setElvPrecision(ElvPrecision precision) {
  currentElvPrecision.store(static_cast<int>(precision), std::memory_order_relaxed);
}
inline ElvPrecision elvPrecision() {
  return static_cast<ElvPrecision>(currentElvPrecision.load(std::memory_order_relaxed));
}
inline const ElvTolerances& elvTolerances() {
  return elvPrecision() == ElvPrecision::Full ? kFullTolerances : kHistoricalTolerances;
}

inline double seriesCutoff() {
  return elvTolerances().seriesCutoff;
}
inline double stepLimit() {
  return elvTolerances().stepLimit;
}
inline double fractionGap() {
  return elvTolerances().fractionGap;
}
inline double mixtureStop() {
  return elvTolerances().mixtureStop;
}

// Holds a precision for the lifetime of the object and restores the one
// found at construction.
class ScopedElvPrecision {
 public:
  explicit ScopedElvPrecision(ElvPrecision precision) : saved_(elvPrecision()) {
    setElvPrecision(precision);
  }
  ~ScopedElvPrecision() { setElvPrecision(saved_); }
  ScopedElvPrecision(const ScopedElvPrecision&) = delete;
  ScopedElvPrecision& operator=(const ScopedElvPrecision&) = delete;

 private:
  ElvPrecision saved_;
};

}  // namespace elv
}  // namespace qel

#endif
