#!/usr/bin/env python3
"""Quantiles of the gamma, chi-square, beta, F and t laws where a shape (or
df) is tiny, 1e-300 to 1e-5, beside a moderate or huge other parameter.

Each quantile is found in u = ln x (bisection, then the Illinois method on
the logarithm of the tail that is the smaller at the target; mpmath at 60
digits, the tails as in gen_small_shape_tails.py), to 1e-40 in u. A
quantile below the smallest normal double is written as 0, one beyond the
largest double as nan. Rows where mpmath's series do not converge (a beta
shape of 1e6 beside a tiny one, near 1) are left out.

Writes tests/data/small_shape_quantiles.csv:
  family,p,param1,param2,expected
(gamma: shape, scale; chisq: df, 0; beta: a, b; f: df1, df2; t: df, 0).
Run: /usr/bin/python3 tools/reference/gen_small_shape_quantiles.py
"""
import os
import sys

import mpmath
from mpmath import mp, mpf

sys.path.insert(0, os.path.dirname(__file__))
from gen_small_shape_tails import beta_tails  # noqa: E402
from refdata import d, write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")
LN_MIN = mpmath.log(d(2.2250738585072014e-308))
LN_MAX = mpmath.log(d(1.7976931348623157e308))
ZERO, NAN, ONE = "zero", "nan", "one"


def solve(tails, which, target, lo, hi):
    """u in [lo, hi] with tails(u)[which] = target; lower tails (which 0)
    increase in u, upper tails (which 1) decrease. ZERO when the quantile lies
    below e^lo, NAN (or ONE, as the caller rules) when above e^hi."""
    def below(u):  # the quantile lies above e^u
        t = tails(u)[which]
        return t < target if which == 0 else t > target
    if not below(lo):
        return ZERO
    if below(hi):
        return NAN
    # Bisection down to a unit interval in u, then the Illinois method on
    # ln(tail) - ln(target), smooth in u.
    while hi - lo > 1:
        mid = (lo + hi) / 2
        if below(mid):
            lo = mid
        else:
            hi = mid
    def g(u):
        return mpmath.log(tails(u)[which]) - mpmath.log(target)
    u = mpmath.findroot(g, (lo, hi), solver="illinois", tol=mpf(10) ** -40)
    return mpmath.exp(u)


def target_of(p):
    """The smaller tail at p: (0, p) or (1, 1 - p), exact for a double p."""
    p = d(p)
    return (0, p) if p <= 0.5 else (1, 1 - p)


def gamma_q(a, p):
    a = d(a)

    def tails(u):
        x = mpmath.exp(u)
        return (mpmath.gammainc(a, 0, x, regularized=True),
                mpmath.gammainc(a, x, mpmath.inf, regularized=True))
    return solve(tails, *target_of(p), LN_MIN, LN_MAX)


def chisq_q(df, p):
    r = gamma_q(d(df) / 2, p)
    return r if isinstance(r, str) else 2 * r


def beta_q(a, b, which, target):
    a, b = d(a), d(b)

    def tails(u):
        x = mpmath.exp(u)
        return beta_tails(a, b, x, 1 - x)
    return solve(tails, which, target, LN_MIN, mpmath.log(1 - mpf(10) ** -30))


def beta_quantile(a, b, p):
    if a <= b:
        r = beta_q(a, b, *target_of(p))
        return 1.0 if r == NAN else r
    # Near 1: x = 1 - w, w the quantile of Beta(b, a) at 1 - p.
    which, target = target_of(p)
    # Below 1e-30 the quantile is solved on Beta(a, b) itself.
    w = beta_q(b, a, 1 - which, target)
    if w == NAN:
        x = beta_q(a, b, which, target)
        return 1.0 if x == NAN else x
    return 1.0 if w == ZERO else 1 - w


def f_q(m, n, p):
    m, n = d(m), d(n)

    def tails(u):
        return beta_tails(m / 2, n / 2, m * mpmath.exp(u), n)
    return solve(tails, *target_of(p), LN_MIN, LN_MAX)


def t_q(n, p):
    """P(T > e^u) = I_z(n/2, 1/2)/2, z = n/(n + e^2u); by symmetry the
    quantile at p < 1/2 is minus that at 1 - p."""
    if p == 0.5:
        return mpf(0)
    n = d(n)

    def tails(u):
        z = n / (n + mpmath.exp(2 * u))
        far = mpmath.betainc(n / 2, mpf(1) / 2, 0, z, regularized=True) / 2
        return 1 - far, far
    r = solve(tails, 1, d(p) if p < 0.5 else 1 - d(p), LN_MIN, LN_MAX)
    if r in (ZERO, NAN):
        return r
    return -r if p < 0.5 else r


def cell(v):
    if v == ZERO or (not isinstance(v, str) and v < d(2.2250738585072014e-308)):
        return "0"
    if v == NAN:
        return "nan"
    return v


TINY = [1e-300, 1e-100, 1e-20, 1e-8, 1e-5]
PS = [1e-300, 1e-100, 1e-10, 0.01, 0.3, 0.5, 0.7, 0.99, 1 - 1e-10]


def rows():
    out = []

    def add(family, p, p1, p2, solve_row):
        try:
            v = solve_row()
        except (ValueError, mpmath.libmp.NoConvergence) as e:
            # mpmath's hypergeometric series fail near 1 at a shape of 1e6.
            print("skipped", family, p, p1, p2, type(e).__name__, file=sys.stderr)
            return
        out.append((family, repr(p), repr(p1), repr(p2), cell(v)))

    for s in TINY:
        for p in PS:
            add("gamma", p, s, 1.0, lambda: gamma_q(s, p))
            add("chisq", p, s, 0.0, lambda: chisq_q(s, p))
            add("t", p, s, 0.0, lambda: t_q(s, p))
            for other in [2.5, 1e6]:
                add("beta", p, s, other, lambda: beta_quantile(s, other, p))
                add("beta", p, other, s, lambda: beta_quantile(other, s, p))
                add("f", p, s, other, lambda: f_q(s, other, p))
                add("f", p, other, s, lambda: f_q(other, s, p))
    # b of 1e-4 puts most of the mass within 1e-16 of 1, where the quantile
    # rounds to 1.
    for s in [1e-4, 3e-4]:
        for other in [1e-3, 0.2, 5.0, 100.0]:
            for p in [1e-10, 0.3, 0.9]:
                add("beta", p, other, s, lambda: beta_quantile(other, s, p))
    return out


def main():
    mp.dps = 60
    path = os.path.join(DATA, "small_shape_quantiles.csv")
    write_rows(path, "family,p,param1,param2,expected", rows())
    print("wrote", path)


if __name__ == "__main__":
    main()
