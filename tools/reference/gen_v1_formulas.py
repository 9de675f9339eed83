#!/usr/bin/env python3
"""Reference values for the v1 distribution functions that compute their own
formula (BetaPdf, BinomialPdf, HypergeometricPdf, WeibullInvCdf, LogGamma,
LogNChooseK). Writes tests/data/v1_formulas.csv:
    function,x,param1,param2,param3,expected
"""
import os
import sys

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import d, write_rows  # noqa: E402

mpmath.mp.dps = 50
OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data", "v1_formulas.csv")


def main():
    rows = []
    for x, a, b in [(0.2, 2.0, 5.0), (0.999, 0.5, 0.5), (1e-8, 1.5, 300.0), (0.5, 40.0, 60.0)]:
        X, A, B = d(x), d(a), d(b)
        rows.append(["BetaPdf", x, a, b, 0.0,
                     X ** (A - 1) * (1 - X) ** (B - 1) / mpmath.beta(A, B)])
    for k, n, p in [(3, 10, 0.25), (0, 20, 0.01), (150, 400, 0.4), (999, 1000, 0.999)]:
        rows.append(["BinomialPdf", float(k), float(n), p, 0.0,
                     mpmath.binomial(n, k) * d(p) ** k * (1 - d(p)) ** (n - k)])
    for k, N, M, n in [(2, 20, 7, 5), (0, 100, 10, 10), (30, 500, 120, 100)]:
        rows.append(["HypergeometricPdf", float(k), float(N), float(M), float(n),
                     mpmath.binomial(M, k) * mpmath.binomial(N - M, n - k) / mpmath.binomial(N, n)])
    for p, k, s, t in [(0.3, 1.7, 2.5, -1.0), (1e-12, 0.5, 1.0, 0.0), (0.999999, 3.0, 10.0, 5.0)]:
        rows.append(["WeibullInvCdf", p, k, s, t, d(t) + d(s) * (-mpmath.log1p(-d(p))) ** (1 / d(k))])
    for x in [0.5, 1.5, 3.0, 10.5, 171.2, 1e5]:
        rows.append(["LogGamma", x, 0.0, 0.0, 0.0, mpmath.loggamma(d(x))])
    for n, k in [(10, 3), (1000, 500), (52, 5)]:
        rows.append(["LogNChooseK", float(n), float(k), 0.0, 0.0, mpmath.log(mpmath.binomial(n, k))])
    write_rows(OUT, "function,x,param1,param2,param3,expected", rows)
    print("wrote", len(rows), "rows")


if __name__ == "__main__":
    main()
