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

namespace qel {
namespace elv {

enum class ElvPrecision {
  Full,     // double precision (the default)
  Historical,  // cut-off 1e-9, mixture stop 5e-10
};

struct ElvTolerances {
  double seriesCutoff;  // smallest term of a scaled series that is added
  double stepLimit;     // relative step limit of the Newton iterations
  double fractionGap;   // relative gap of continued-fraction convergents
  double mixtureStop;   // tail weight and relative rest of a mixture sum
};

// Process-wide; a change applies to the runs that start after it.
void setElvPrecision(ElvPrecision precision);
ElvPrecision elvPrecision();
const ElvTolerances& elvTolerances();

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
