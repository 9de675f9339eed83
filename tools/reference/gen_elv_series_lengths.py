#!/usr/bin/env python3
"""Lengths of the scaled series of the ELV routines under the two precision
settings: the number of terms 1, t1, t1 t2, ... taken before the first term
below the cut-off (1e-9 for the historical setting, 1.4e-17 at double
precision), from the published ratios of consecutive terms:

  gamma_Iax(a, x)          t(j) = x / (a + j)
  poisson_Ik(k, m)         t(j) = m / (k + j)
  binomial_Ik(k, n, p)     t(j) = (n - k - j) / (k + j + 1) p / (1 - p),
                           at most n - k - 1 terms
  hyper_Ik(k, N, M, n)     t(j) = (M - i + 1)(n - i + 1) / (i (N - M - n + i)),
                           i = k + j, and 0 beyond min(M, n)

Products are formed in 50-digit arithmetic; a case whose crossing term lies
within 1e-6 of the cut-off is left out. Writes tests/data/elv_series_lengths.csv
with rows  helper,setting,arg1,arg2,arg3,arg4,terms.
Run: /usr/bin/python3 tools/reference/gen_elv_series_lengths.py
"""
import os
import sys

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import write_rows  # noqa: E402

mpmath.mp.dps = 50
CUTOFFS = {"historical": mpf("1e-9"), "full": mpf(1.4e-17)}


def length(ratio, cutoff, available=None):
    term, n = mpf(1), 0
    while term >= cutoff:
        if available is not None and n >= available:
            return n
        n += 1
        term *= ratio(n)
        if n > 10**6:
            raise RuntimeError("series too long")
    if abs(term / cutoff - 1) < mpf("1e-6"):
        return None
    return n


def main():
    rows = []
    cases = []
    for a, x in ((0.5, 0.3), (3.5, 2.0), (20.0, 15.0), (1000.0, 950.0), (1e5, 99000.0)):
        A, X = mpf(a), mpf(x)
        cases.append(("gamma_Iax", [a, x, 0, 0], lambda j, A=A, X=X: X / (A + j), None))
    for k, m in ((0, 0.5), (10, 3.0), (50, 40.0), (2000, 1900.0)):
        K, Mm = mpf(k), mpf(m)
        cases.append(("poisson_Ik", [k, m, 0, 0], lambda j, K=K, Mm=Mm: Mm / (K + j), None))
    for k, n, p in ((5, 10, 0.3), (30, 100, 0.2), (600, 5000, 0.1), (60, 100000, 4e-4)):
        K, N, Y = mpf(k), mpf(n), mpf(p) / (1 - mpf(p))
        cases.append(("binomial_Ik", [k, n, p, 0],
                      lambda j, K=K, N=N, Y=Y: (N - K - j) / (K + j + 1) * Y, n - k - 1))
    for k, N, M, n in ((3, 20, 7, 5), (15, 50, 25, 30), (80, 1000, 400, 150),
                       (2100, 100000, 40000, 5000)):
        def r(j, k=k, N=mpf(N), M=mpf(M), n=mpf(n)):
            i = k + j
            if i > min(M, n):
                return mpf(0)
            return (M - i + 1) * (n - i + 1) / (i * (N - M - n + i))
        cases.append(("hyper_Ik", [k, N, M, n], r, None))
    for helper, args, ratio, available in cases:
        for setting, cutoff in CUTOFFS.items():
            n = length(ratio, cutoff, available)
            if n is not None:
                rows.append([helper, setting] + [repr(float(v)) for v in args] + [str(n)])
    write_rows(os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data",
                            "elv_series_lengths.csv"),
               "helper,setting,arg1,arg2,arg3,arg4,terms", rows)


if __name__ == "__main__":
    main()
