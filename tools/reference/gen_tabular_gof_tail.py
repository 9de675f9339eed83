#!/usr/bin/env python3
"""Reference values for the chi-square goodness-of-fit test from mpmath.

1. Far upper tails: small tables whose statistic puts the P-value anywhere
   from 1e-3 down to about 1e-299. The statistic is the exact sum, at 60
   digits, of the contributions formed from the double inputs; the P-value
   is the regularized upper incomplete gamma Q(df/2, x/2).
2. A sum that plain summation gets wrong: k = 1000001 equal categories,
   total 3k (every expected count exactly 3), observed 4 everywhere except
   3 + 2^28 in the first. Each small contribution is the double 1*(1/3);
   the exact sum of the double contributions is written.

Writes tests/data/tabular_gof_mpmath.csv.
Run: python3 tools/reference/gen_tabular_gof_tail.py
"""
import os

import mpmath as mp

mp.mp.dps = 60
HERE = os.path.dirname(os.path.abspath(__file__))
OUT = os.path.join(HERE, "..", "..", "tests", "data", "tabular_gof_mpmath.csv")

# (observed counts, proportions or None for equal ones); total = sum.
TAILS = [
    ([60, 40, 20], None),
    ([300, 100, 50, 50], [0.4, 0.3, 0.2, 0.1]),
    ([880, 60, 60], None),
    ([885, 57, 58], None),
    ([700, 150, 150], None),
    ([600, 200, 200], None),
    ([1500, 300, 350, 330], None),
    ([1e6, 999000, 1002000, 1001500, 997000], None),
    ([4000, 1400, 1600], [0.5, 0.3, 0.2]),
    ([52, 11, 7, 30, 0, 0], [0.3, 0.1, 0.1, 0.2, 0.2, 0.1]),
]


def contributions(obs, props):
    k = len(obs)
    total = float(sum(obs))
    out = []
    for i, o in enumerate(obs):
        # The expected count as the library forms it, in double.
        e = props[i] * total if props is not None else total / k
        d = mp.mpf(o) - mp.mpf(e)
        out.append(d * d / mp.mpf(e))
    return total, out


def main():
    rows = ["# From tools/reference/gen_tabular_gof_tail.py (mpmath, 60 digits).",
            "# tail,observed(;),proportions(; or -),statistic,pValue",
            "# sum,k,total,first,other,exactSum"]
    for obs, props in TAILS:
        total, c = contributions(obs, props)
        x = mp.fsum(c)
        df = len(obs) - 1
        p = mp.gammainc(mp.mpf(df) / 2, x / 2, mp.inf, regularized=True)
        rows.append("tail,%s,%s,%s,%s" % (
            ";".join(repr(float(o)) for o in obs),
            ";".join(repr(float(q)) for q in props) if props else "-",
            mp.nstr(x, 20, min_fixed=-1, max_fixed=-1),
            mp.nstr(p, 20, min_fixed=-1, max_fixed=-1)))
    k = 1000001
    total = 3.0 * k
    e = total / k
    first = 3.0 + 2.0 ** 28
    d0 = first - e
    big = d0 * (d0 / e)  # the library's double contribution
    small = 1.0 * (1.0 / e)
    exact = mp.mpf(big) + (k - 1) * mp.mpf(small)
    rows.append("sum,%d,%r,%r,%r,%s" % (k, total, first, 4.0,
                                        mp.nstr(exact, 25, min_fixed=-1, max_fixed=-1)))
    with open(OUT, "w") as f:
        f.write("\n".join(rows) + "\n")


if __name__ == "__main__":
    main()
