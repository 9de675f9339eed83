// Densities and masses by the saddle-point forms of Loader (C. Loader, "Fast
// and accurate computation of binomial probabilities", 2000): a mass is
// written as exp(-stirlerr - bd0) over a square root, where Stirling's error
// term stirlerr and the deviance term bd0(x, m) = x ln(x/m) + m - x are each
// formed without cancellation. The result keeps its relative accuracy for
// parameters in the millions, where differences of ln Gamma lose it.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_SADDLE_DENSITY_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_SADDLE_DENSITY_H

namespace qel {
namespace saddle {

// ln Gamma(n + 1) - (n + 1/2) ln n + n - ln sqrt(2 pi), n >= 0.
double stirlerr(double n);
// x ln(x/m) + m - x for x >= 0, m > 0.
double bd0(double x, double m);
// e^-m m^x / Gamma(x + 1) for real x >= 0, m >= 0.
double poissonMass(double x, double m);
// Gamma(n+1)/(Gamma(x+1) Gamma(n-x+1)) p^x q^(n-x), q = 1 - p given apart,
// for real 0 <= x <= n.
double binomialMass(double x, double n, double p, double q);

// Densities at x (0 where x is outside the open support), for any positive
// normal shapes; the gamma density at d = x - threshold > 0 with its scale.
double gammaDensity(double d, double shape, double scale);
double betaDensity(double x, double a, double b);
double fDensity(double x, double m, double n);
double tDensity(double x, double n);
double hypergeometricMass(double k, double N, double M, double n);

}  // namespace saddle
}  // namespace qel

#endif
