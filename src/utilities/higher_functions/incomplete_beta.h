// Regularised incomplete beta ratio I_x(a, b) and its complement: ACM TOMS
// Algorithm 708 (DiDonato & Morris 1992, "Significant digit computation of the
// incomplete beta function ratios") in double precision, with its
// sub-procedures as free functions. Not exported from the shared library.
#ifndef QEL_SRC_UTILITIES_INCOMPLETEBETA_H
#define QEL_SRC_UTILITIES_INCOMPLETEBETA_H

namespace qel {

// w = I_x(a, b), w1 = 1 - w, y = 1 - x given by the caller. ierr: 0 none,
// 1 a or b negative (or NaN or infinite), 2 a = b = 0, 3 x outside [0, 1], 4 y outside [0, 1],
// 5 x + y not 1 within 3 eps (NaN x or y: 3 or 4), 6 x = a = 0, 7 y = b = 0. Never throws.
void BRATIO(double a, double b, double x, double y, double* w, double* w1, int* ierr);

// BRATIO(a, b, x, 1 - x given as y); w, or w1 when complement is true. An
// invalid argument set answers 0.
double mIncompleteBetaRatio(double x, double y, double a, double b, bool complement);

// I_x(a, b) - I_x(a + n, b), n >= 1.
double bup(double a, double b, double x, double y, int n, double eps);
// Power series for I_x(a, b) (b <= 1 or b x <= 0.7).
double bpser(double a, double b, double x, double eps);
// I_(1-x)(b, a) for a <= min(eps, eps b), b x <= 1, x <= 0.5.
double apser(double a, double b, double x, double eps);
// I_x(a, b) for b < min(eps, eps a), x <= 0.5.
double fpser(double a, double b, double x, double eps);
// Continued fraction for I_x(a, b), a, b > 1; lambda = (a + b) y - b.
double bfrac(double a, double b, double x, double y, double lambda, double eps);
// Adds the asymptotic expansion of I_x(a, b) for large a, b <= 1 to *w.
void bgrat(double a, double b, double x, double y, double* w, double eps, int* ierr);
// P(a, x) and Q(a, x) for a <= 1 with r = exp(-x) x^a / Gamma(a).
void grat1(double a, double x, double r, double* p, double* q, double eps);
// Asymptotic expansion of I_x(a, b) for large a and b.
double basym(double a, double b, double lambda, double eps);

// x^a y^b / Beta(a, b), and the same times exp(mu).
double brcomp(double a, double b, double x, double y);
double brcmp1(int mu, double a, double b, double x, double y);
double betaln(double a0, double b0);  // ln Beta(a0, b0)
// For a0 < 1 < b0 < 8: the two factors of the reduction of b0 by
// Gamma(b0) = (b0 - 1) Gamma(b0 - 1) in TOMS 708 (bpser, brcomp), such that
// x^a0 y^b0 / Beta(a0, b0) = a0 exp(z - u) k / t with z = a0 ln x + b0 ln y.
void smallShapeFactors(double a0, double b0, double* u, double* k, double* t);
double algdiv(double a, double b);   // ln(Gamma(b)/Gamma(a + b)), b >= 8
double bcorr(double a0, double b0);  // del(a0) + del(b0) - del(a0 + b0), a0, b0 >= 8
double gsumln(double a, double b);   // ln Gamma(a + b), 1 <= a, b <= 2
double alnrel(double a);             // ln(1 + a)
double esum(int mu, double x);       // exp(mu + x)

}  // namespace qel

#endif
