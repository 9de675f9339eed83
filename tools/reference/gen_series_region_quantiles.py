#!/usr/bin/env python3
"""Quantiles of gamma, chi-square and beta laws at small shapes (0.005 to
0.1), from p = 1e-300 to 1 - 1e-6: writes tests/data/series_region_quantiles.csv
in the layout of distribution_precision.csv
(family,function,x,param1..param4,expected).

Here the lower tail rises like x^a, so a quantile turns a tail's relative
error into a relative error 1/a times larger, and quantiles of p = 0.01 lie
near 1e-100: the grid checks that the quantiles keep their digits there.

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


def gamma_quantile(a, p):
    A, P = d(a), d(p)

    def f(y):
        if p <= 0.5:
            return mpmath.gammainc(A, 0, y, regularized=True) - P
        return (1 - P) - mpmath.gammainc(A, y, mpmath.inf, regularized=True)
    x0 = (P * mpmath.gamma(A + 1)) ** (1 / A)
    return root_in_log(f, x0, mpmath.mpf(10) ** 20)


def beta_quantile(a, b, p):
    A, B, P = d(a), d(b), d(p)

    def f(y):
        if p <= 0.5:
            return mpmath.betainc(A, B, 0, y, regularized=True) - P
        return (1 - P) - mpmath.betainc(B, A, 0, 1 - y, regularized=True)
    x0 = (P * A * mpmath.beta(A, B)) ** (1 / A)
    return root_in_log(f, min(x0, mpmath.mpf(0.5)), 1 - mpmath.mpf(10) ** -40)


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
    # Quantiles below 1e-300 are left out: there the answer is 0 or a
    # subnormal number, which the tests do not compare.
    rows = [r for r in rows if r[-1] >= mpmath.mpf(10) ** -300]
    header = "family,function,x,param1,param2,param3,param4,expected"
    write_rows(os.path.join(DATA, "series_region_quantiles.csv"), header, rows)


if __name__ == "__main__":
    main()
