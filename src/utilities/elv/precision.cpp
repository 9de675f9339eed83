// Precision setting of the ELV routines (see precision.h).
#include "utilities/elv/precision.h"

#include <atomic>

namespace qel {
namespace elv {

namespace {

// Full: a series stops once its term falls below 2^-56 of the leading 1, so
// the dropped rest is far below one unit in the last place. Newton and the
// continued fractions stop at a relative step of 1e-13 / gap of 2e-15: the
// quadratic convergence of Newton puts the applied last step's error near
// 1e-26, and a continued-fraction midpoint is off by half the gap, while the
// rounding noise of a tail (a few units of 1e-16) can never stall either.
constexpr ElvTolerances kFull = {1.4e-17, 1e-13, 2e-15, 1e-17};
constexpr ElvTolerances kHistorical = {1e-9, 1e-9, 1e-9, 5e-10};

std::atomic<int> current{static_cast<int>(ElvPrecision::Full)};

}  // namespace

void setElvPrecision(ElvPrecision precision) {
  current.store(static_cast<int>(precision), std::memory_order_relaxed);
}

ElvPrecision elvPrecision() {
  return static_cast<ElvPrecision>(current.load(std::memory_order_relaxed));
}

const ElvTolerances& elvTolerances() {
  return elvPrecision() == ElvPrecision::Full ? kFull : kHistorical;
}

}  // namespace elv
}  // namespace qel
