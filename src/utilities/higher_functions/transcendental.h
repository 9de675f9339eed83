// Special functions of the distribution layer (see the list below).
#ifndef QEL_SRC_UTILITIES_HIGHER_FUNCTIONS_TRANSCENDENTAL_H
#define QEL_SRC_UTILITIES_HIGHER_FUNCTIONS_TRANSCENDENTAL_H

#include <vector>

#include "utilities/CheckedFunctions.h"

namespace qel {

// ---------------------------------------------------------------------------
// Gamma, incomplete gamma, psi and the constants of the arithmetic.
// Algorithms: ACM TOMS 708 (DiDonato & Morris 1992) for the gamma helpers,
// error function and psi; ACM TOMS 654 (DiDonato & Morris 1986) for the
// incomplete gamma ratio; SLATEC DPSIFN (Amos, ACM TOMS 610, 1983) for
// polygamma; AS 187 (Moore 1982) for the derivatives of the incomplete gamma
// integral; the Lanczos form (g = 7, nine terms) for XGAMMA and mLogGamma.
// Only the m... functions check their arguments.

// Integer constants of binary double arithmetic, 1-based, no range check.
int ipmpar(int i);
// 1: the relative spacing 2^-52; 2: the smallest normal double; 3: DBL_MAX.
double spmpar(int i);
// Only D1MACH(4) (2^-52) and D1MACH(5) (log10 2) are defined; other indices
// answer NaN. Only I1MACH(14), (15), (16) are defined; others answer 0.
double D1MACH(int i);
int I1MACH(int i);
// l == 0: largest w with exp(w) finite; otherwise the most negative w with
// exp(w) nonzero. Both scaled by 0.99999.
double exparg(int l);

double XGAMMA(double x);
double XGAMMLN(double x);
double gamln(double a);   // ln Gamma(a), a > 0
double gamln1(double a);  // ln Gamma(1 + a), -0.2 <= a <= 1.25
double gam1(double a);    // 1/Gamma(a + 1) - 1, -0.5 <= a <= 1.5
double rlog(double x);    // x - 1 - ln x
double rlog1(double x);   // x - ln(1 + x)
double rexp(double x);    // exp(x) - 1
double erf(double x);
// erfc(x) for ind == 0, exp(x*x) erfc(x) otherwise.
double erfc1(int ind, double x);
// Digamma of TOMS 708 (Cody, Strecok & Thacher approximations); 0 at poles.
double psi(double x);

// ans[k-1] = (-1)^(k+n) / Gamma(n+k) * psi^(n+k-1)(x), k = 1..m; kode 2 with
// n == 0 gives -psi(x) + ln x in ans[0]. ierr: 1 bad input, 2 overflow, 3 order
// beyond the table; nz counts the entries set to 0 by underflow.
void XDPSIFN(double x, int n, int kode, int m, double* ans, int* nz, int* ierr);
// The Bernoulli numbers of DPSIFN (1-based: B_0, B_1, B_2, B_4, ..., B_40), shared
// with the private order-0 copy of the incomplete beta ratio.
extern const double kDpsifnBernoulli[23];

// d[0..5] = dI/dx, d2I/dx2, dI/dp, d2I/dp2, d2I/dxdp, I for the incomplete
// gamma integral I(x, p); ifault 1 when a series or fraction does not settle.
void DIGAMI(double* d, double x, double p, double gplog, double gp1log, double psip, double psip1,
            double psidp, double psidp1, int* ifault);

// Regularised lower incomplete gamma P(dP, dX).
double mIncompleteGamma(double dX, double dP);
// P(a, x) and Q(a, x) by Temme's uniform expansion as GRATIO evaluates it
// (TOMS 654, first accuracy level), for a >= 40 and |1 - x/a| <= 0.25 only,
// where its truncations stay near the rounding level; false, with *p and *q
// untouched, elsewhere.
bool temmeGammaRatios(double a, double x, double* p, double* q);
// P(a, x) and Q(a, x) by GRATIO's series for 0 < a < 1 and 0 < x < 1.1, by
// the error function for a = 1/2 and any finite x > 0; false elsewhere.
bool smallShapeGammaRatios(double a, double x, double* p, double* q);
double mLogGamma(double x);
double mGamma(double x, bool throwOnError);
double mPsi(double x);
void mPsiDerivatives(double x, int n, bool scaled, int m, std::vector<double>& out, int& nz);
void mIncompleteGammaDerivatives(double x, double p, std::vector<double>& out);
double mErrorFunction(double x, bool complement);

}  // namespace qel

#endif
