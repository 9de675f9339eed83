// Forwarding wrappers of the normal, t and hypergeometric ELV routines (see
// ELVwrappers.h). Outputs are pointers to caller-owned values.
#include <qel/elv.h>

#include "utilities/ELVwrappers.h"

namespace qel {

namespace {

ElvStatus currentStatus() {
  return static_cast<ElvStatus>(ELVerrno);
}

}  // namespace

ElvStatus elv_normal_df(double x, double* lower, double* upper) {
  normal_df(x, lower, upper);
  return currentStatus();
}

ElvStatus elv_inv_normal_df(double p, double* quantile) {
  inv_normal_df(p, quantile);
  return currentStatus();
}

}  // namespace qel
