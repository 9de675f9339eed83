#!/usr/bin/env python3
"""Reference values for the beta, F, Student t (central and noncentral) and
binomial kernels on the ELV beta and t families: densities, both tails each
computed in its own right, and quantiles.

Writes tests/data/kernels_beta_t.csv with rows
    family,function,x,param1,param2,param3,param4,expected
(the layout of kernels.csv). Noncentral t tails are integrals over the
chi-square mixing variable, noncentral F tails Poisson mixtures of beta
ratios. Binomial quantiles are the smallest k with P(X <= k) >= p, for p
kept away from the jumps.
Run: /usr/bin/python3 tools/reference/gen_kernels_beta_t.py
"""
import math
import os
import sys

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
from gen_kernels import PS, quantile_rows, rows_for, solve_increasing  # noqa: E402
from refdata import d, write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")


def I(x, a, b):
    return mpmath.betainc(a, b, 0, x, regularized=True)


def t_tails(t, df):
    x = df / (df + t * t)
    half = I(x, df / 2, mpf(1) / 2) / 2
    return (half, 1 - half) if t < 0 else (1 - half, half)


def nct_tails(t, df, delta):
    # P(T <= t) = E[Phi(t sqrt(V/df) - delta)], V chi-square on df.
    def dens(u):
        return mpmath.exp((df / 2 - 1) * mpmath.log(u) - u / 2 - (df / 2) * mpmath.log(2)
                          - mpmath.loggamma(df / 2))
    lo = mpmath.quad(lambda u: mpmath.ncdf(t * mpmath.sqrt(u / df) - delta) * dens(u),
                     [0, df, 4 * df + 40, mpmath.inf])
    up = mpmath.quad(lambda u: mpmath.ncdf(delta - t * mpmath.sqrt(u / df)) * dens(u),
                     [0, df, 4 * df + 40, mpmath.inf])
    return lo, up


def student(df, delta):
    k, dl = d(df), d(delta)
    if delta == 0:
        tails = lambda x: t_tails(x, k)  # noqa: E731
        pdf = lambda x: mpmath.exp(mpmath.loggamma((k + 1) / 2) - mpmath.loggamma(k / 2)  # noqa
                                   - mpmath.log(mpmath.pi * k) / 2
                                   - (k + 1) / 2 * mpmath.log1p(x * x / k))
        xs = [-1e4, -40, -6, -1.5, -1e-6, 0.0, 0.4, 2.5, 9, 300]
        ps = PS
    else:
        tails = lambda x: nct_tails(x, k, dl)  # noqa: E731
        pdf = None
        xs = [delta - 3, delta - 0.5, delta + 0.3, delta + 2.5]
        ps = [0.05, 0.5, 0.9]
    mpmath.mp.dps = 30

    def inv(p):
        # The median of the central t is 0; tails near 0 are flat to 30 digits.
        if delta == 0 and p == mpf(1) / 2:
            return mpf(0)
        return solve_increasing(lambda y: tails(y)[0] - p, -1e12, 1e12)
    rows = rows_for("t", [df, delta], xs, ps, pdf, lambda x: tails(x)[0],
                    lambda x: tails(x)[1], inv)
    mpmath.mp.dps = 60
    return rows


def fdist(d1, d2, lam):
    a, b, L = d(d1) / 2, d(d2) / 2, d(lam)

    def tails(x):
        y = d(d1) * x / (d(d1) * x + d(d2))
        if lam == 0:
            return I(y, a, b), I(1 - y, b, a)
        h = L / 2
        lo = up = mpf(0)
        for j in range(0, 2000):
            w = mpmath.exp(-h + j * mpmath.log(h) - mpmath.loggamma(j + 1))
            lo += w * I(y, a + j, b)
            up += w * I(1 - y, b, a + j)
            if j > h + 10 and w < mpf(10) ** -40:
                break
        return lo, up
    pdf = None
    if lam == 0:
        pdf = lambda x: mpmath.exp(mpmath.loggamma(a + b) - mpmath.loggamma(a)  # noqa: E731
                                   - mpmath.loggamma(b) + a * mpmath.log(d(d1) / d(d2))
                                   + (a - 1) * mpmath.log(x)
                                   - (a + b) * mpmath.log1p(x * d(d1) / d(d2)))
    xs = [1e-4, 0.05, 0.5, 1.0, 2.2, 8.0, 60.0]
    ps = PS[1:-1] if lam == 0 else [0.1, 0.5, 0.95]
    return rows_for("f", [d1, d2, lam], xs, ps, pdf, lambda x: tails(x)[0],
                    lambda x: tails(x)[1],
                    lambda p: solve_increasing(lambda y: tails(y)[0] - p, mpf(10) ** -30,
                                               mpf(10) ** 15, logscale=True))


def beta(a, b):
    A, B = d(a), d(b)
    xs = [1e-10, 1e-4, 0.05, 0.3, 0.5, 0.77, 0.99, 1 - 1e-7]
    return rows_for("beta", [a, b], xs, PS,
                    lambda x: mpmath.exp((A - 1) * mpmath.log(x) + (B - 1) * mpmath.log1p(-x)
                                         - mpmath.log(mpmath.beta(A, B))),
                    lambda x: I(x, A, B), lambda x: I(1 - x, B, A),
                    lambda p: solve_increasing(lambda y: I(y, A, B) - p, mpf(10) ** -3000, 1,
                                               logscale=True))


def binomial_quantiles(n, p):
    P = d(p)

    def low(k):
        if k < 0:
            return mpf(0)
        if k >= n:
            return mpf(1)
        return mpmath.betainc(n - k, k + 1, 0, 1 - P, regularized=True)
    return quantile_rows("binomial", [n, p], PS[1:-1], low, 0, n)


def main():
    rows = []
    for df, delta in ((1.0, 0.0), (3.5, 0.0), (30.0, 0.0), (1000.0, 0.0), (10.0, 1.5),
                      (4.0, -2.0), (25.0, 4.0)):
        rows += student(df, delta)
    for d1, d2, lam in ((1.0, 1.0, 0.0), (3.0, 12.0, 0.0), (20.0, 7.5, 0.0), (300.0, 400.0, 0.0),
                        (4.0, 10.0, 3.0), (2.0, 30.0, 25.0)):
        rows += fdist(d1, d2, lam)
    for a, b in ((0.5, 0.5), (2.0, 3.0), (0.2, 7.0), (50.0, 40.0), (1.0, 1.0)):
        rows += beta(a, b)
    for n, p in ((10, 0.5), (20, 0.1), (100, 0.73), (1000, 0.002), (5000, 0.4)):
        rows += binomial_quantiles(n, p)
    write_rows(os.path.join(DATA, "kernels_beta_t.csv"),
               "family,function,x,param1,param2,param3,param4,expected", rows)


if __name__ == "__main__":
    main()
