// Double-precision normal tail and quantile behind normal_df and the normal
// quantile routines.
#ifndef QEL_SRC_UTILITIES_ELV_NORMAL_PRECISE_H
#define QEL_SRC_UTILITIES_ELV_NORMAL_PRECISE_H

namespace qel {
namespace elv {

// P(Z > x) for x >= 0, to a few units in the last place down to the
// smallest double; 0 beyond x = 38.6.
double normalUpperTail(double x);

// z with P(Z <= z) = p for 0 < p < 1 (AS 241, Wichura 1988), accurate to
// about 1e-16 relative over the whole range of doubles.
double normalQuantile(double p);

}  // namespace elv
}  // namespace qel

#endif
