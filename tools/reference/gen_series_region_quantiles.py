#!/usr/bin/env python3
"""Quantiles of gamma, chi-square and beta laws at small shapes (0.005 to
0.1), from p = 1e-300 to 1 - 1e-6: writes tests/data/series_region_quantiles.csv
in the layout of distribution_precision.csv
(family,function,x,param1..param4,expected).

Here the lower tail rises like x^a, so a quantile turns a tail's relative
error into a relative error 1/a times larger, and quantiles of p = 0.01 lie
near 1e-100: the grid checks that the quantiles keep their digits there.
Shapes 0.3 to 1 add quantiles at chosen points from 1e-250 to x = 0.55 (b x
= 1.1 for the beta law), across the end of the lower tail's power-series
region.

Each quantile is the root of P(X <= x) - p (of P(X > x) - (1 - p) above
p = 1/2) by bisection in ln x at 50 digits, on a bracket around the leading
term of the lower tail, x0 = (p a B)^(1/a) (beta) or (p Gamma(a + 1))^(1/a)
(gamma), that is widened until it holds the root.
"""
import os
import sys

import mpmath

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
from refdata import d, write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "tests", "data")
SHAPES = (0.005, 0.01, 0.02, 0.05, 0.1)
PS = (1e-300, 1e-100, 1e-12, 1e-6, 0.01, 0.3, 0.5, 0.9, 0.999999)
BETA_B = (0.5, 4.0, 100.0)
CHISQ_DF = (0.02, 0.05, 0.1)
# Larger shapes at probabilities whose quantiles are chosen points x: from
# 1e-250, where ln x is large, to either side of x = 1/2 (of b x = 1 for the
# beta law), where the power series gives way to the general route.
EDGE_X = (1e-250, 1e-30, 0.1, 0.45, 0.5, 0.55)
EDGE_GAMMA = (0.3, 0.7, 1.0)
EDGE_BETA = ((0.3, 2.5), (0.7, 1000.0), (1.0, 0.3))
# Small b beside a small a: ln(a B(a, b)) is near a/b, far above a.
SMALL_B = ((0.003, 0.02), (0.05, 0.001), (0.3, 0.001))


def root_in_log(f, x0, top):
    """Root of the increasing f by bisection in ln x, from a bracket of
    x0 e^(-+40) widened until f changes sign; top bounds the support."""
    lo, hi = mpmath.log(x0) - 40, min(mpmath.log(x0) + 40, mpmath.log(top))
    while f(mpmath.exp(lo)) > 0:
        lo -= 200
    while f(mpmath.exp(hi)) < 0:
        hi = (hi + mpmath.log(top)) / 2 if top < 1e10 else hi + 40
    for _ in range(220):
        mid = (lo + hi) / 2
        if f(mpmath.exp(mid)) < 0:
            lo = mid
        else:
            hi = mid
    return mpmath.exp((lo + hi) / 2)


def gamma_quantile(a, p, x0=None):
    A, P = d(a), d(p)

    def f(y):
        if p <= 0.5:
            return mpmath.gammainc(A, 0, y, regularized=True) - P
        return (1 - P) - mpmath.gammainc(A, y, mpmath.inf, regularized=True)
    x0 = x0 or (P * mpmath.gamma(A + 1)) ** (1 / A)
    return root_in_log(f, x0, mpmath.mpf(10) ** 20)


def beta_quantile(a, b, p, x0=None):
    A, B, P = d(a), d(b), d(p)

    def f(y):
        if p <= 0.5:
            return mpmath.betainc(A, B, 0, y, regularized=True) - P
        return (1 - P) - mpmath.betainc(B, A, 0, 1 - y, regularized=True)
    x0 = x0 or min((P * A * mpmath.beta(A, B)) ** (1 / A), mpmath.mpf(0.5))
    return root_in_log(f, x0, 1 - mpmath.mpf(10) ** -40)


def main():
    mpmath.mp.dps = 50
    rows = []
    for a in SHAPES:
        for p in PS:
            rows.append(["gamma", "inv", p, a, 1.0, 0.0, 0.0, gamma_quantile(a, p)])
            for b in BETA_B:
                rows.append(["beta", "inv", p, a, b, 0.0, 0.0, beta_quantile(a, b, p)])
    for df in CHISQ_DF:
        for p in PS:
            rows.append(["chisq", "inv", p, df, 0.0, 0.0, 0.0, 2 * gamma_quantile(df / 2, p)])
    for a, b in SMALL_B:
        # Only p whose quantile lies clear of 1 (the rest of the mass sits
        # next to 1, beyond the bisection's bracket).
        for p in (p for p in PS if (d(p) * d(a) * mpmath.beta(d(a), d(b))) ** (1 / d(a)) < 0.4):
            rows.append(["beta", "inv", p, a, b, 0.0, 0.0, beta_quantile(a, b, p)])
    for a in EDGE_GAMMA:
        for x in EDGE_X:
            p = float(mpmath.gammainc(d(a), 0, d(x), regularized=True))
            rows.append(["gamma", "inv", p, a, 1.0, 0.0, 0.0, gamma_quantile(a, p, d(x))])
    for a, b in EDGE_BETA:
        for x in EDGE_X:
            x = x * 2 / b if b > 2 else x
            p = float(mpmath.betainc(d(a), d(b), 0, d(x), regularized=True))
            rows.append(["beta", "inv", p, a, b, 0.0, 0.0, beta_quantile(a, b, p, d(x))])
    # Quantiles below 1e-300 are left out: there the answer is 0 or a
    # subnormal number, which the tests do not compare.
    rows = [r for r in rows if r[-1] >= mpmath.mpf(10) ** -300]
    header = "family,function,x,param1,param2,param3,param4,expected"
    write_rows(os.path.join(DATA, "series_region_quantiles.csv"), header, rows)

    log_rows = []
    for p in (2.2250738585072014e-308, 1e-300, 1e-100, 3e-17, 1e-6, 0.01, 0.3, 0.5,
              0.7071067811865476, 0.9, 0.999999, 1 - 1e-10, 1 - 2.0 ** -53):
        ln = mpmath.log(d(p))
        hi = float(ln)
        log_rows.append([p, hi, ln - d(hi)])
    write_rows(os.path.join(DATA, "double_double_log.csv"), "p,hi,lo", log_rows)


if __name__ == "__main__":
    main()
