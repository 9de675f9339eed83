// Tails of the gamma and beta laws where a shape is tiny (at most 1e-5) or
// the argument lies below 1e-280. There the law puts almost all its mass at
// one end and the opposite tail is of the order of the shape (of 1e-298 at a
// shape of 1e-300), below the smallest tail the general kernels form
// directly; their complements lose it entirely.
//
// Both routines work from the power series of the incomplete integrals
// (Abramowitz & Stegun 6.5.29, 26.5.4 in the form of DLMF 8.17.8)
//   P(a, z)   = z^a / Gamma(1 + a) (1 + a sum_k>=1 (-z)^k / ((a + k) k!)),
//   I_x(a, b) = x^a G(a, b) (1 + a sum_k>=1 (1 - b)_k x^k / ((a + k) k!)),
// G(a, b) = Gamma(a + b) / (Gamma(1 + a) Gamma(b)), taken in logarithms: the
// logarithm of the tail near 1 is of the order of the tiny shape and keeps
// its relative accuracy, so the other tail is -expm1 of it to the last digit.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_SMALL_SHAPE_TAILS_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_SMALL_SHAPE_TAILS_H

namespace qel {
namespace smallshape {

// A shape at or below this is tiny: its squares fall below 1e-10 of it, so
// second-order terms in it stay within reach of a short Taylor series.
constexpr double kTinyShape = 1e-5;
// Arguments below this put the direct tail under the general kernels' floor.
constexpr double kTinyArgument = 1e-280;

// P(a, z) and Q(a, z) for a <= kTinyShape or z < kTinyArgument, with
// lz = ln z given apart (z itself may be below the normal range). False
// elsewhere, or for arguments outside (0, inf).
bool gammaTails(double a, double z, double lz, double* lower, double* upper);

// I_x(a, b) and 1 - I_x(a, b) where min(a, b) <= kTinyShape, from x and
// y = 1 - x with their logarithms lx and ly given apart (either may be
// below the normal range). False where the series would cancel (the other
// shape above 250 with x near its end), for the caller's routines.
bool betaTails(double a, double b, double x, double lx, double y, double ly, double* lower,
               double* upper);

// I_x(a, b) and its complement at x < kTinyArgument (ln x = lx) for shapes
// above kTinyShape: the leading term x^a G(a, b), with b x negligible.
// False where b x is not negligible or the shapes leave the series' range.
bool betaTailsAtTinyArgument(double a, double b, double x, double lx, double* lower, double* upper);

}  // namespace smallshape
}  // namespace qel

#endif
