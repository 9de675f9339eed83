#!/usr/bin/env python3
"""Sign confidence levels with nonlinear interpolation, from exact binomial
sums (n <= 50) and the continuity-corrected normal law (n > 50) in mpmath.

level(d) = 1 - 2 P(X <= d), X ~ Bin(n, 1/2), is the confidence of the
interval (x(d+1), x(n-d)); level(0) = 1 - 2^(1-n) exactly. The depth d is
the first with level(d) <= confidence <= level(d-1) (or n // 2), lambda =
(n - d) r / (d + (n - 2d) r) with r = (level(d-1) - conf) / (level(d-1) -
level(d)) (Hettmansperger and Sheather, 1986).
Writes tests/data/sint.csv: n,confidence,kind,d,level1,level2,lambda.
Run: python3 tools/reference/gen_sint.py
"""
import os

import mpmath as mp

mp.mp.dps = 40
HERE = os.path.dirname(os.path.abspath(__file__))
OUT = os.path.join(HERE, "..", "..", "tests", "data", "sint.csv")


def level(n, d):
    if d == 0:
        return 1 - mp.mpf(2) ** (1 - n)
    if n > 50:
        z = (d + mp.mpf(0.5) - mp.mpf(n) / 2) / mp.sqrt(mp.mpf(n) / 4)
        return 1 - 2 * mp.ncdf(z)
    return 1 - 2 * mp.fsum(mp.binomial(n, j) for j in range(d + 1)) / mp.mpf(2) ** n


def main():
    out = ["# From tools/reference/gen_sint.py (mpmath, 40 digits).",
           "# n,confidence,kind,d,level1,level2,lambda (level2 nan for kind 1)"]
    for n in list(range(2, 51)) + [51, 60, 101, 500, 2000]:
        for conf in (0.5, 0.8, 0.9, 0.95, 0.99, 0.999):
            a = level(n, 0)
            if conf >= a:
                out.append("%d,%r,1,1,%s,nan,0" % (n, conf, mp.nstr(a, 20)))
                continue
            d = 1
            while True:
                b = level(n, d)
                if b <= conf <= a or d >= n // 2:
                    break
                a = b
                d += 1
            r = (a - conf) / (a - b)
            lam = (n - d) * r / (d + (n - 2 * d) * r)
            kind = 2 if d >= n // 2 else 0
            out.append("%d,%r,%d,%d,%s,%s,%s" % (n, conf, kind, d, mp.nstr(a, 20), mp.nstr(b, 20),
                                                 mp.nstr(lam, 20)))
    with open(OUT, "w") as f:
        f.write("\n".join(out) + "\n")


if __name__ == "__main__":
    main()
