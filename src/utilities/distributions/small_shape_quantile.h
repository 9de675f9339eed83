// Quantiles of the gamma, beta, F and t laws at a tiny shape or df (at most
// 1e-5). There nearly all the mass sits at one end of the support: most
// quantiles lie below the smallest normal double (answered 0) or beyond the
// largest (no double: the missing value), and the rest lie where the
// general tail kernels, and the quantile routines built on them, have lost
// the tail of the order of the shape. The quantile is solved in logarithms
// (tail_quantile.h) on tails that keep it (small_shape_tails.h).
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_SMALL_SHAPE_QUANTILE_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_SMALL_SHAPE_QUANTILE_H

#include "utilities/distributions/tail_quantile.h"

namespace qel {
namespace smallshape {

// x with P(X <= x) = p, 0 < p < 1: 0 where x lies below DBL_MIN (below
// -DBL_MAX on the real line: the missing value), 1 where it lies above the
// largest double under 1 on (0, 1), the missing value above DBL_MAX; the
// root of the smaller tail from start otherwise.
double quantile(const TailPair& tails, double p, TailSupport support, double start);

}  // namespace smallshape
}  // namespace qel

#endif
