#!/usr/bin/env python3
"""Exact reference values for the moment family, from rational arithmetic.

The data sets are generated from a 32-bit linear congruential generator
(Numerical Recipes: s' = 1664525 s + 1013904223 mod 2^32) so that the test
suite can rebuild them bit for bit without committing a million numbers.
Every generated value is an exact double; sums, means and central sums of
powers are computed exactly with integers and fractions, and only the final
square roots (skewness, correlation) go through mpmath at 60 digits.

Data sets (the C++ side is tests/unit/moments_data.h):
  offset     n = 1000000  x = 1e9 + k 2^-23,          k = s >> 12
  offset_small n = 2000   the same with seed 11
  skewed     n = 60000    x = 1e6 + ((s >> 22))^2 2^-20
  magnitudes n = 100000   x = +-(2^20 + m) 2^(e-20),  e in [-40, 40]
  pair       n = 10000    x = 1e9 + k 2^-23, y = 5e8 - k 2^-22 + v 2^-24
  ties       n = 500      x = (s >> 16) mod 20, y = x + (s' >> 16) mod 7
  small      2, 4, 4, 4, 5, 5, 7, 9
  three      1, 2, 10     (no kurtosis: it needs four values)

Writes tests/data/moments.csv with rows dataset,quantity,expected.
Run: /usr/bin/python3 tools/reference/gen_moments.py
"""
import os
import sys
from fractions import Fraction

import mpmath

sys.path.insert(0, os.path.dirname(__file__))
from refdata import write_rows  # noqa: E402

OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data", "moments.csv")


def lcg(seed):
    s = seed
    while True:
        s = (1664525 * s + 1013904223) & 0xFFFFFFFF
        yield s


def offset(n, seed):
    """Integers k with x = 1e9 + k 2^-23; returns (offset, scale, ks)."""
    g = lcg(seed)
    return Fraction(10**9), Fraction(1, 2**23), [next(g) >> 12 for _ in range(n)]


def skewed(n, seed):
    g = lcg(seed)
    return Fraction(10**6), Fraction(1, 2**20), [(next(g) >> 22) ** 2 for _ in range(n)]


def magnitudes(n, seed):
    """Values as integers over the common denominator 2^60."""
    g = lcg(seed)
    ks = []
    for _ in range(n):
        s1 = next(g)
        s2 = next(g)
        e = (s1 >> 8) % 81 - 40
        m = s2 >> 12
        v = (2**20 + m) << (e - 20 + 60)
        ks.append(-v if s1 >> 31 else v)
    return Fraction(0), Fraction(1, 2**60), ks


def pair(n, seed):
    g = lcg(seed)
    xs, ys = [], []
    for _ in range(n):
        k = next(g) >> 12
        v = next(g) >> 12
        xs.append(Fraction(10**9) + Fraction(k, 2**23))
        ys.append(Fraction(5 * 10**8) - Fraction(k, 2**22) + Fraction(v, 2**24))
    return xs, ys


def ties(n, seed):
    g = lcg(seed)
    xs, ys = [], []
    for _ in range(n):
        x = (next(g) >> 16) % 20
        y = x + (next(g) >> 16) % 7
        xs.append(Fraction(x))
        ys.append(Fraction(y))
    return xs, ys


def mp(q):
    return mpmath.mpf(q.numerator) / q.denominator


def central_sums(base, scale, ks):
    """Exact mean and central sums of powers 2..4 of x = base + scale*k."""
    n = len(ks)
    s1 = sum(ks)
    s2 = sum(k * k for k in ks)
    s3 = sum(k * k * k for k in ks)
    s4 = sum(k**4 for k in ks)
    mu = Fraction(s1, n)
    m2 = s2 - mu * s1
    m3 = s3 - 3 * mu * s2 + 3 * mu**2 * s1 - n * mu**3
    m4 = s4 - 4 * mu * s3 + 6 * mu**2 * s2 - 4 * mu**3 * s1 + n * mu**4
    return (base + scale * mu, m2 * scale**2, m3 * scale**3, m4 * scale**4,
            n * base + scale * s1)


def single_rows(name, base, scale, ks):
    n = len(ks)
    mean, m2, m3, m4, total = central_sums(base, scale, ks)
    nn = mpmath.mpf(n)
    skew = mp(m3 / m2) * (nn / (nn - 2)) * mpmath.sqrt(mp((n - 1) / m2))
    kurt = None
    if n >= 4:
        kurt = (mp(Fraction(n - 1, (n - 2) * (n - 3)))
                * (n * (n + 1) * mp(m4 / (m2 * m2)) - 3 * (n - 1)))
    rows = [
        (name, "n", str(n)),
        (name, "sum", mp(total)),
        (name, "mean", mp(mean)),
        (name, "variance", mp(m2 / (n - 1))),
        (name, "m2", mp(m2)),
        (name, "m3", mp(m3)),
        (name, "m4", mp(m4)),
        (name, "skewness", skew),
        (name, "kurtosis", kurt),
    ]
    return rows


def pearson_parts(xs, ys):
    n = len(xs)
    mx = sum(xs) / n
    my = sum(ys) / n
    sxx = sum((x - mx) ** 2 for x in xs)
    syy = sum((y - my) ** 2 for y in ys)
    sxy = sum((x - mx) * (y - my) for x, y in zip(xs, ys))
    return sxx, syy, sxy


def pearson(sxx, syy, sxy):
    return mp(sxy) / mpmath.sqrt(mp(sxx * syy))


def average_ranks(values):
    order = sorted(range(len(values)), key=lambda i: values[i])
    ranks = [None] * len(values)
    p = 0
    while p < len(order):
        m = 1
        while p + m < len(order) and values[order[p + m]] == values[order[p]]:
            m += 1
        for j in range(p, p + m):
            ranks[order[j]] = Fraction(2 * p + m + 1, 2)
        p += m
    return ranks


def main():
    mpmath.mp.dps = 60
    rows = []
    rows += single_rows("offset", *offset(1000000, 7))
    rows += single_rows("offset_small", *offset(2000, 11))
    rows += single_rows("skewed", *skewed(60000, 5))
    rows += single_rows("magnitudes", *magnitudes(100000, 3))
    rows += single_rows("small", Fraction(0), Fraction(1), [2, 4, 4, 4, 5, 5, 7, 9])
    rows += single_rows("three", Fraction(0), Fraction(1), [1, 2, 10])

    xs, ys = pair(10000, 2)
    n = len(xs)
    sxx, syy, sxy = pearson_parts(xs, ys)
    rows += [("pair", "n", str(n)),
             ("pair", "sxx", mp(sxx)), ("pair", "syy", mp(syy)), ("pair", "sxy", mp(sxy)),
             ("pair", "covariance", mp(sxy / (n - 1))),
             ("pair", "pearson", pearson(sxx, syy, sxy))]

    xs, ys = ties(500, 4)
    sxx, syy, sxy = pearson_parts(average_ranks(xs), average_ranks(ys))
    rows += [("ties", "n", str(len(xs))),
             ("ties", "pearson", pearson(*pearson_parts(xs, ys))),
             ("ties", "spearman", pearson(sxx, syy, sxy))]

    write_rows(OUT, "dataset,quantity,expected (exact rational arithmetic, rounded)", rows)


if __name__ == "__main__":
    main()
