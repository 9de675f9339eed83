#!/usr/bin/env python3
"""Writes 2^(j/32), j = 0..31, as double-double pairs (hi, lo) with
hi + lo equal to the value to about 1e-32, for the double-double exponential.

Run from the repository root:
  python3 tools/reference/gen_exp2_table.py > src/utilities/higher_functions/exp2_table.inc
"""
from mpmath import mp, mpf

mp.dps = 50
print("// 2^(j/32) for j = 0..31 as (hi, lo): tools/reference/gen_exp2_table.py (mpmath, 50 digits).")
for j in range(32):
    v = mpf(2) ** (mpf(j) / 32)
    hi = float(v)
    lo = float(v - mpf(hi))
    print("{%s, %s}," % (repr(hi), repr(lo)))
