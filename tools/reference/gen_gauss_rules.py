#!/usr/bin/env python3
"""Gauss-Hermite, generalised Gauss-Laguerre and Gauss-Legendre rules from
mpmath.gauss_quadrature at 40 digits.

Writes tests/data/gauss_rules.csv, rows family,alpha,n,node,weight (all n
nodes of each rule, ascending). Legendre 16 and 48 are checked against
/work/shared/reference/gauss.txt instead.
Run: python3 tools/reference/gen_gauss_rules.py
"""
import os

import mpmath as mp

mp.mp.dps = 40
HERE = os.path.dirname(os.path.abspath(__file__))
OUT = os.path.join(HERE, "..", "..", "tests", "data", "gauss_rules.csv")


def rows(family, qtype, n, alpha=0):
    x, w = mp.gauss_quadrature(n, qtype, alpha=alpha) if alpha else mp.gauss_quadrature(n, qtype)
    pairs = sorted(zip(x, w), key=lambda p: p[0])
    return ["%s,%s,%d,%s,%s" % (family, repr(float(alpha)), n, mp.nstr(xi, 20), mp.nstr(wi, 20))
            for xi, wi in pairs]


def main():
    out = ["# From tools/reference/gen_gauss_rules.py (mpmath.gauss_quadrature, 40 digits).",
           "# family,alpha,n,node,weight"]
    for n in (1, 2, 5, 16, 33, 64):
        out += rows("hermite", "hermite", n)
    for alpha in (0, 0.5, -0.5, 3):
        for n in (1, 4, 16, 33, 64):
            out += rows("laguerre", "glaguerre" if alpha else "laguerre", n, alpha)
    for n in (7, 20, 64):
        out += rows("legendre", "legendre", n)
    with open(OUT, "w") as f:
        f.write("\n".join(out) + "\n")


if __name__ == "__main__":
    main()
