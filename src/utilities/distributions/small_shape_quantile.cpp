#include "utilities/distributions/small_shape_quantile.h"

#include <cfloat>

#include "utilities/LYNBasicTypes.h"

namespace qel {
namespace smallshape {

namespace {

// True when the quantile at p lies above x, decided on the smaller tail so
// that 1 - p = 1e-300 keeps its digits; false where the tails fail.
bool quantileAbove(const TailPair& tails, double p, double x, bool* known) {
  double lower = 0.0, upper = 0.0;
  *known = tails(x, &lower, &upper) && !mIsNumericMissing(lower) && !mIsNumericMissing(upper);
  return p <= 0.5 ? lower < p : upper > 0.5 + (0.5 - p);
}

}  // namespace

double quantile(const TailPair& tails, double p, TailSupport support, double start) {
  const double low = support == TailSupport::RealLine ? -DBL_MAX : DBL_MIN;
  const double high = support == TailSupport::Unit ? 1.0 - DBL_EPSILON / 2.0 : DBL_MAX;
  bool known = false;
  if (!quantileAbove(tails, p, low, &known) && known) {
    return support == TailSupport::RealLine ? mGetMissingValueCode() : 0.0;
  }
  if (quantileAbove(tails, p, high, &known) && known) {
    return support == TailSupport::Unit ? 1.0 : mGetMissingValueCode();
  }
  return mTailQuantile(tails, p, support, start);
}

}  // namespace smallshape
}  // namespace qel
