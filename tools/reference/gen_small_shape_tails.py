#!/usr/bin/env python3
"""Both tails of the gamma, chi-square, beta, F and t laws where a shape (or
df) is tiny, from 1e-300 to 1e-4, or where the argument lies below 1e-280:
the law puts almost all its mass at one end, and the other tail is of the
order of the tiny shape.

The smaller tail is computed directly by mpmath, the other as 1 minus it, at
60 digits plus those that 1 - (beta argument) needs exactly.

Writes tests/data/small_shape_tails.csv with the columns of
extreme_shapes.csv: family,function,x,param1,param2,expected,condition
(condition 0: tails only; expected 0 below 1e-330).
Run: /usr/bin/python3 tools/reference/gen_small_shape_tails.py
"""
import os
import sys

import mpmath
from mpmath import mp, mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")


def d(x):
    return mpf(float(x))


def beta_tails(a, b, num, other):
    """I_y(a, b) and I_w(b, a) for y = num/(num + other), w = other/(num +
    other). The smaller tail is computed directly, the other as 1 minus it;
    the working precision covers the digits of 1 - (the smaller argument)."""
    y, w = num / (num + other), other / (num + other)
    digits = 60 + int(max(0, -mpmath.log10(min(y, w))))
    with mp.workdps(digits):
        y, w = num / (num + other), other / (num + other)
        lo = mpmath.betainc(a, b, 0, y, regularized=True)
        if lo <= 0.5:
            return +lo, 1 - lo
        up = mpmath.betainc(b, a, 0, w, regularized=True)
        return 1 - up, +up


def clamp(v):
    return mpf(0) if v < mpf(10) ** -330 else v


def rows():
    out = []

    def add(family, x, p1, p2, tails):
        lo, up = tails
        out.append((family, "lower", repr(x), repr(p1), repr(p2), clamp(lo), "0"))
        out.append((family, "upper", repr(x), repr(p1), repr(p2), clamp(up), "0"))

    gamma_shapes = [1e-300, 1e-200, 1e-30, 1e-20, 1e-16, 1e-8, 1e-5, 1e-4, 0.01, 0.9, 1.0, 1.1]
    gamma_x = [1e-300, 1e-290, 1e-281, 1e-200, 1e-30, 1e-5, 0.3, 1.0, 3.0, 30.0, 300.0, 700.0]
    for a in gamma_shapes:
        for x in gamma_x:
            add("gamma", x, a, 1.0, (mpmath.gammainc(d(a), 0, d(x), regularized=True),
                                     mpmath.gammainc(d(a), d(x), mpmath.inf, regularized=True)))
    for df in [2e-300, 2e-20, 2e-5, 2.0, 2.2]:
        for x in [2e-300, 2e-290, 1e-200, 0.6, 6.0, 1300.0]:
            h = d(df) / 2
            add("chisq", x, df, 0.0, (mpmath.gammainc(h, 0, d(x) / 2, regularized=True),
                                      mpmath.gammainc(h, d(x) / 2, mpmath.inf, regularized=True)))
    shapes = [1e-300, 1e-30, 1e-8, 1e-5, 0.5, 1.0, 3.0, 50.0]
    xs = [1e-300, 1e-285, 1e-10, 1e-3, 0.3, 0.7, 0.999, 1 - 2.0 ** -40]
    for a in shapes:
        for b in shapes:
            tiny = min(a, b) <= 1e-5
            for x in xs if tiny else xs[:2]:
                with mp.workdps(400):
                    w = 1 - d(x)  # exact
                add("beta", x, a, b, beta_tails(d(a), d(b), d(x), w))
    # A tiny shape beside a huge one: the scale of the law is 1/b.
    for a in [1e-300, 1e-10]:
        for b in [1e25, 1e300]:
            for bx in [1e-5, 0.1, 3.0]:
                x = bx / b
                with mp.workdps(400):
                    w = 1 - d(x)  # exact
                add("beta", x, a, b, beta_tails(d(a), d(b), d(x), w))
    for m in [1e-300, 1e-30, 1e-8, 2e-5]:
        for n in [1e-300, 1e-30, 1e-8, 2e-5]:
            for x in [1e-300, 1e-10, 1.0, 1e10, 1e300]:
                # P(F <= x) = I_y(m/2, n/2), y = m x/(n + m x), 1 - y = n/(n + m x)
                add("f", x, m, n, beta_tails(d(m) / 2, d(n) / 2, d(m) * d(x), d(n)))
    for n in [1e-300, 1e-100, 1e-30, 1e-20, 1e-12, 1e-6, 1e-5]:
        for t in [-1e300, -1e10, -2.0, -1e-5, 1e-300, 0.5, 3.0, 1e20]:
            # the tail beyond |t| is I_z(n/2, 1/2)/2, z = n/(n + t^2)
            z = d(n) / (d(n) + d(t) ** 2)
            far = mpmath.betainc(d(n) / 2, mpf(1) / 2, 0, z, regularized=True) / 2
            near = 1 - far
            add("t", t, n, 0.0, (far, near) if t < 0 else (near, far))
    return out


def main():
    mp.dps = 60
    path = os.path.join(DATA, "small_shape_tails.csv")
    write_rows(path, "family,function,x,param1,param2,expected,condition", rows())
    print("wrote", path)


if __name__ == "__main__":
    main()
