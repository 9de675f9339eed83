// Quantiles of the gamma and beta laws at small shapes where the answer lies
// in the region of the lower tail's power series (x up to about 1/2).
//
// There the lower tail rises like x^a: a quantile turns the relative error of
// the tail (and of ln p, and of the final exponential) into a relative error
// 1/a times larger, so Newton's method on a tail computed in double
// precision loses one to two digits at a = 0.01 to 0.1. Instead ln x is
// solved from the series in logarithms,
//   ln P = a ln x - ln N + ln(1 + a S(x)),
// where N = Gamma(1 + a) (gamma) or a B(a, b) (beta) and S is a series that
// depends only weakly on x; the part (ln p + ln N)/a, large where x is tiny,
// and the final exponential are carried in double-double arithmetic.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_SERIES_QUANTILE_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_SERIES_QUANTILE_H

namespace qel {
namespace seriesquantile {

// x with P(a, x) = p (gamma law of scale 1) for 1e-5 < a <= kLargestShape
// and 2^-1022 <= p < 1, at the full ELV precision: true with *x (0 where x
// lies below the smallest normal double) when x lies in the series region,
// false otherwise (the caller's own method answers).
bool gammaQuantile(double p, double a, double* x);

// x with I_x(a, b) = p, under the same conditions on a and p and for
// 1e-5 < b <= 1e15; the series region also bounds b x.
bool betaQuantile(double p, double a, double b, double* x);

}  // namespace seriesquantile
}  // namespace qel

#endif
