// The exported distribution families and the exported P-value and
// critical-value functions: each is a frame around its kernel. The family
// table lives in tools/codegen/gen_distribution_api.py, which writes the
// definitions included below and the declarations of <qel/distributions.h>.
#include <qel/distributions.h>

#include "interfaces/math/frames.h"
#include "utilities/distributions/kernels.h"

namespace qel {

namespace {

// The geometric law is the negative binomial with r = 1.
double geometricPdf(double x, double p) {
  return mNegBinomialPdf(x, p, 1.0);
}
double geometricCdf(double x, double p, bool upperTail) {
  return mNegBinomialCdf(x, p, 1.0, upperTail);
}
double geometricInvCdf(double p, double prob) {
  return mNegBinomialInvCdf(p, prob, 1.0);
}

// The smallest extreme value density is the largest one mirrored.
double smallestExtremeValuePdf(double x, double location, double scale) {
  return mLargestExtremeValuePdf(-x, -location, scale);
}

}  // namespace

#include "interfaces/math/random_distributions_table.inc"

}  // namespace qel
