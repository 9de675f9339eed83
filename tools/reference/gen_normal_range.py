#!/usr/bin/env python3
"""The range R of k independent standard normal variables, from mpmath at
60 digits:
  P(R <= r) = k int phi(x) (Phi(x + r) - Phi(x))^(k-1) dx,
  P(R > r)  = k int phi(x) (Q(x)^(k-1) - (Q(x) - Q(x + r))^(k-1)) dx,
with the quadrature split into unit panels from -r/2 - 10 (the mass of a
far upper tail lies near -r/2) to 10, and run twice: mpmath.quad judges
its error in absolute terms, so an integral of 1e-100 passes unresolved
(errors of 1e-3 seen); the second pass integrates f / (first value).
For k = 2 the closed forms erf(r/2) and erfc(r/2).
The quantiles are checked by inverting these tails.
Writes tests/data/normal_range.csv: cdf,k,r,lower,upper.
Run: python3 tools/reference/gen_normal_range.py
"""
import os

import mpmath as mp

mp.mp.dps = 60
HERE = os.path.dirname(os.path.abspath(__file__))
OUT = os.path.join(HERE, "..", "..", "tests", "data", "normal_range.csv")


def Q(x):
    return mp.erfc(x / mp.sqrt(2)) / 2


def panels(r):
    start = mp.floor(-r / 2 - 10)
    n = int(10 - start)
    return [-mp.inf] + [start + i for i in range(n + 1)] + [mp.inf]


def scaled(f, r):
    first = mp.quad(f, panels(r))
    return first * mp.quad(lambda x: f(x) / first, panels(r))


def lower(r, k):
    if k == 2:
        return mp.erf(r / 2)
    return scaled(lambda x: k * mp.npdf(x) * (Q(x) - Q(x + r)) ** (k - 1), r)


def upper(r, k):
    if k == 2:
        return mp.erfc(r / 2)
    return scaled(lambda x: k * mp.npdf(x) * (Q(x) ** (k - 1) - (Q(x) - Q(x + r)) ** (k - 1)), r)


def main():
    out = ["# From tools/reference/gen_normal_range.py (mpmath, 60 digits).",
           "# cdf,k,r,lower,upper"]
    for k in (2, 3, 10, 50):
        # At r = 30 mpmath.quad misses the upper tail of k >= 3 by 3e-4 even
        # so; there P(R > r) = C(k, 2) erfc(r/2) to 1e-90, which the test uses.
        # r = 1e-10 and 1e-3: the lower tail where Phi(x + r) - Phi(x)
        # cancels in double precision.
        for r in (1e-10, 1e-3, 0.1, 0.5, 2.0, 5.0, 12.0) + ((30.0,) if k == 2 else ()):
            r = mp.mpf(r)
            out.append("cdf,%d,%s,%s,%s" % (k, mp.nstr(r, 5), mp.nstr(lower(r, k), 20),
                                            mp.nstr(upper(r, k), 20)))
    with open(OUT, "w") as f:
        f.write("\n".join(out) + "\n")


if __name__ == "__main__":
    main()
