#!/usr/bin/env python3
"""The table of Stirling's error term
    stirlerr(n) = ln Gamma(n + 1) - (n + 1/2) ln n + n - ln sqrt(2 pi)
at n = 0.5, 1, ..., 15 (stirlerr(0) = 0 by convention), used by Loader's
saddle-point densities in src/utilities/distributions/saddle_density.cpp;
printed as C++ initialisers with 17 significant digits (mpmath, 50 digits).
Run: /usr/bin/python3 tools/reference/gen_stirling_table.py
"""
import mpmath

mpmath.mp.dps = 50
values = [mpmath.mpf(0)]
for i in range(1, 31):
    n = mpmath.mpf(i) / 2
    values.append(mpmath.loggamma(n + 1) - (n + mpmath.mpf(1) / 2) * mpmath.log(n) + n
                  - mpmath.log(mpmath.sqrt(2 * mpmath.pi)))
for v in values:
    print("    " + mpmath.nstr(v, 17, min_fixed=-1, max_fixed=-1) + ",")
