#!/usr/bin/env python3
"""Derives the coefficient tables of the far-tail expansion of the noncentral
t lower tail (t_expansion_approx) for integer degrees of freedom m = 1..12,
writes them as src/utilities/elv/t_expansion_table.inc, and checks the truncated
expansion against the lower tail integrated by mpmath.

Derivation. For T = (Z + delta)/sqrt(V/m) the density is

    f(x) = K a^(-(m+1)/2) e^(-delta^2 c/2) M_m(y) / sqrt(2 pi),
    a = m + x^2,  c = m/a,  K = 2 (m/2)^(m/2)/Gamma(m/2),  y = delta x/sqrt(a),
    M_m(y) = integral_0^inf u^m e^(-(u-y)^2/2) du.

Integration by parts gives M_0 = sqrt(2 pi) Phi(y), M_1 = e^(-y^2/2) + y M_0
and M_m = y M_(m-1) + (m-1) M_(m-2), so M_m = p_m(y) e^(-y^2/2)
+ q_m(y) sqrt(2 pi) Phi(y) with integer polynomials p_m, q_m. For x < 0,
y = -delta s with s = sqrt(1-c), and e^(-delta^2 c/2) e^(-y^2/2) = e^(-delta^2/2).
With Q the upper normal tail,

    Phi(-delta s) = Q(delta s) = Q(delta) + phi(delta) W(c),
    W(c) = integral_0^c e^(delta^2 v/2) delta/(2 sqrt(1-v)) dv,

so e^(-delta^2 c/2) M_m(-delta s) = sqrt(2 pi) [P(c) phi(delta) + R(c) Q(delta)]
with P(c) = p_m(-delta s) + q_m(-delta s) e^(-delta^2 c/2) W(c) and
R(c) = q_m(-delta s) e^(-delta^2 c/2), both power series in c whose
coefficients P_j, R_j are polynomials in delta. The density is then
const * sum_j c^((m+1)/2 + j) [P_j phi + R_j Q], and integrating term by term
from -inf to t gives the lower tail

    F(t) = -sqrt(2 pi)/(sqrt(m) B) sum_j A(j) kappa [P_j phi(delta) + R_j Q(delta)],
    A(j) = integral_-inf^t c(x)^((m+1)/2 + j) dx,  B = Beta(1/2, m/2),
    kappa = -2^((1-m)/2) / Gamma((m+1)/2).

A(0) = B sqrt(m) times the central t lower tail, and d/dx [x c^p] =
(1-2p) c^p + 2p c^(p+1) gives A(j) = (t c^((m+2j-1)/2) + (m+2j-2) A(j-1))
/(m+2j-1). The series is truncated after j = 3, so the error is of relative
order c^4 times a polynomial of degree 8 in delta.

kappa is rational for odd m but carries 1/sqrt(pi) for even m, so the
polynomials cannot all have integer coefficients under the common factor
alone: each m gets integer coefficients and one positive scale factor,
kappa P_j = scale * (integer polynomial), likewise for R_j.

Run: /usr/bin/python3 tools/reference/derive_t_expansion.py
"""
import math
import os
import sys

import mpmath
import sympy as sp
from mpmath import mp, mpf

HERE = os.path.dirname(os.path.abspath(__file__))
sys.path.insert(0, HERE)
from gen_elv_t_noncentral import tail  # noqa: E402

OUT = os.path.join(HERE, "..", "..", "src", "utilities", "elv", "t_expansion_table.inc")
TERMS = 4  # A(0) .. A(3)
MAX_M = 12

delta, c, y, v = sp.symbols("delta c y v")


def bessel_like_polys(m):
    """p_m, q_m with M_m(y) = p_m(y) e^(-y^2/2) + q_m(y) sqrt(2 pi) Phi(y)."""
    p0, q0 = sp.Integer(0), sp.Integer(1)
    if m == 0:
        return p0, q0
    p1, q1 = sp.Integer(1), y
    for k in range(2, m + 1):
        p0, q0, p1, q1 = p1, q1, sp.expand(y * p1 + (k - 1) * p0), sp.expand(y * q1 + (k - 1) * q0)
    return p1, q1


def check_polys():
    """M_m from the polynomials against direct quadrature."""
    mp.dps = 30
    for m in (1, 4, 9):
        p, q = bessel_like_polys(m)
        for yy in (mpf(-2.5), mpf("0.7")):
            direct = mpmath.quad(lambda u: u ** m * mpmath.exp(-(u - yy) ** 2 / 2), [0, 5, mpmath.inf])
            pv = mpf(str(sp.N(p.subs(y, sp.Rational(str(yy))), 40)))
            qv = mpf(str(sp.N(q.subs(y, sp.Rational(str(yy))), 40)))
            formula = pv * mpmath.exp(-yy ** 2 / 2) + qv * mpmath.sqrt(2 * mpmath.pi) * mpmath.ncdf(yy)
            assert abs(formula / direct - 1) < mpf(10) ** -25, (m, yy)


def series_coefficients(m):
    """Lists P_j, R_j (j < TERMS) as sympy polynomials in delta."""
    p, q = bessel_like_polys(m)
    s = sp.sqrt(1 - c)
    integrand = sp.series(sp.exp(delta ** 2 * v / 2) * delta / (2 * sp.sqrt(1 - v)), v, 0, TERMS)
    W = sp.integrate(integrand.removeO(), (v, 0, c))
    E = sp.exp(-delta ** 2 * c / 2)
    Pc = sp.series(p.subs(y, -delta * s) + q.subs(y, -delta * s) * E * W, c, 0, TERMS).removeO()
    Rc = sp.series(q.subs(y, -delta * s) * E, c, 0, TERMS).removeO()
    P = [sp.Poly(sp.expand(Pc.coeff(c, j)), delta) for j in range(TERMS)]
    R = [sp.Poly(sp.expand(Rc.coeff(c, j)), delta) for j in range(TERMS)]
    return P, R


def integer_table(m):
    """(scale, exact scale, integer P_j, integer R_j) for one m."""
    P, R = series_coefficients(m)
    kappa = -sp.Integer(2) ** sp.Rational(1 - m, 2) / sp.gamma(sp.Rational(m + 1, 2))
    coeffs = [x for poly in P + R for x in poly.all_coeffs()]
    denominator = sp.ilcm(*[sp.Rational(x).q for x in coeffs])
    numerators = [int(sp.Rational(x) * denominator) for x in coeffs]
    common = math.gcd(*[abs(n) for n in numerators if n != 0])
    # kappa is negative: fold its sign into the integers, keep the scale > 0.
    scale = sp.simplify(-kappa * common / denominator)
    Pi = [[-int(x * denominator / common) for x in reversed(poly.all_coeffs())] for poly in P]
    Ri = [[-int(x * denominator / common) for x in reversed(poly.all_coeffs())] for poly in R]
    for row in Pi + Ri:
        for n in row:
            assert abs(n) < 2 ** 53, (m, n)  # exact as a double
    return scale, Pi, Ri


def expansion_parts(t, df, dl, scale, Pi, Ri):
    """The truncated expansion evaluated in mpmath (its truncation error only),
    as the kernel forms it: m = int(df) for the table, B and c, the central t
    tail of the true df for A(0). Returns the value and its condition number:
    the sum of the magnitudes of all products (with A(j) taken as the sum of
    the magnitudes of its recursion's parts) over the magnitude of their sum,
    which multiplies the relative error of the inputs."""
    t, dl, df = mpf(t), mpf(dl), mpf(df)
    m = int(df)
    B = mpmath.beta(mpf(1) / 2, mpf(m) / 2)
    cc = m / (m + t * t)
    central = mpmath.betainc(df / 2, mpf(1) / 2, 0, df / (df + t * t), regularized=True) / 2
    A = [B * mpmath.sqrt(m) * central]
    # Magnitudes of A(j) as the recursion forms them (its two parts cancel).
    size = [A[0]]
    for j in range(1, TERMS):
        power = cc ** (mpf(m + 2 * j - 1) / 2)
        A.append((t * power + (m + 2 * j - 2) * A[-1]) / (m + 2 * j - 1))
        size.append((abs(t) * power + (m + 2 * j - 2) * size[-1]) / (m + 2 * j - 1))
    ph, Q = mpmath.npdf(dl), mpmath.ncdf(-dl)
    total, magnitude = 0, 0
    for j in range(TERMS):
        pv = sum(mpf(a) * dl ** k for k, a in enumerate(Pi[j]))
        rv = sum(mpf(a) * dl ** k for k, a in enumerate(Ri[j]))
        total += A[j] * (pv * ph + rv * Q)
        magnitude += size[j] * (abs(pv * ph) + abs(rv * Q))
    factor = -mpmath.sqrt(2 * mpmath.pi) / (mpmath.sqrt(m) * B) * mpf(scale)
    return factor * total, magnitude / abs(total)


def tables():
    """The integer tables of m = 1..MAX_M, with each scale as an mpmath string."""
    out = []
    for m in range(1, MAX_M + 1):
        scale, Pi, Ri = integer_table(m)
        out.append((scale, str(sp.N(scale, 45)), Pi, Ri))
    return out


def write_include(tables):
    degree = max(len(row) for _, Pi, Ri in tables for row in Pi + Ri) - 1
    lines = [
        "// Generated by tools/reference/derive_t_expansion.py; do not edit.",
        "// Far-tail expansion of the noncentral t lower tail for integer df m:",
        "//   lower = -sqrt(2 pi)/(sqrt(m) B) * scale",
        "//           * sum_j A(j) [phiPoly_j(delta) phi(delta) + tailPoly_j(delta) Q(delta)]",
        "// Coefficients are integers in ascending powers of delta.",
        "constexpr int kExpansionTerms = %d;" % TERMS,
        "constexpr int kExpansionDegree = %d;" % degree,
        "struct ExpansionEntry {",
        "  double scale;",
        "  double phiPoly[kExpansionTerms][kExpansionDegree + 1];",
        "  double tailPoly[kExpansionTerms][kExpansionDegree + 1];",
        "};",
        "constexpr ExpansionEntry kExpansionTable[%d] = {" % MAX_M,
    ]

    def poly_rows(rows):
        out = []
        for row in rows:
            padded = row + [0] * (degree + 1 - len(row))
            out.append("     {" + ", ".join("%d.0" % n for n in padded) + "},")
        return out

    for m, (scale, Pi, Ri) in enumerate(tables, start=1):
        lines.append("    // m = %d, scale = %s" % (m, scale))
        lines.append("    {%s," % mpmath.nstr(mpf(str(sp.N(scale, 40))), 17, min_fixed=-1, max_fixed=-1))
        lines.append("     {")
        lines += poly_rows(Pi)
        lines.append("     },")
        lines.append("     {")
        lines += poly_rows(Ri)
        lines.append("     }},")
    lines.append("};")
    with open(OUT, "w") as f:
        f.write("\n".join(lines) + "\n")


def main():
    check_polys()
    all_tables = tables()
    write_include([(scale, Pi, Ri) for scale, _, Pi, Ri in all_tables])
    # Truncation error of the 4-term expansion against the integrated tail.
    mp.dps = 40
    print("relative truncation error (mpmath, no rounding):")
    for m in range(1, MAX_M + 1):
        _, scale, Pi, Ri = all_tables[m - 1]
        ts = (-10.0, -30.0, -300.0) if m <= 6 else (-25.5, -60.0, -300.0)
        for t in ts:
            errs = []
            for dl in (-3.0, 1.0, 3.0, 5.0, 10.0):
                ref = tail(mpf(t), mpf(m), mpf(dl), False)
                got, _ = expansion_parts(t, m, dl, scale, Pi, Ri)
                errs.append("%.1e" % float(abs(got / ref - 1)))
            print("  m=%2d t=%7.1f delta -3,1,3,5,10: %s" % (m, t, " ".join(errs)))


if __name__ == "__main__":
    main()
