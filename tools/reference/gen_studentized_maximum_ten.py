"""Studentized maximum and maximum modulus of ten variables with distinct
lambdas 0.1 .. 0.9 by mpmath, from the central region to far upper tails.

The integrals are those of gen_studentized_maximum.py (imported: composite
24-point Gauss-Legendre rules in z and in log s, 25 digits).
Writes tests/data/studentized_maximum_ten_mp.csv:
  kind (max|mod), df, x, upper tail.
Run from the repository root: python3 tools/reference/gen_studentized_maximum_ten.py
"""
import os
import sys
from multiprocessing import Pool

from mpmath import mp, mpf, inf

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
from gen_studentized_maximum import upper  # noqa: E402

TEN = [mpf(v) for v in ("0.1", "0.2", "0.3", "0.4", "0.5", "0.6", "0.7", "0.8", "0.85", "0.9")]
POINTS = [("max", 20, "5.5"), ("mod", 20, "3.0"), ("mod", 20, "6.5"), ("mod", inf, "8.5"),
          ("max", inf, "8.0")]


def row(point):
    kind, df, x = point
    return "%s,%s,%s,%s\n" % (kind, df, x, mp.nstr(upper(kind, TEN, df, mpf(x)), 20))


if __name__ == "__main__":
    # Two processes: a row takes minutes.
    with Pool(2) as pool:
        rows = pool.map(row, POINTS)
    with open("tests/data/studentized_maximum_ten_mp.csv", "w") as out:
        out.write("# From tools/reference/gen_studentized_maximum_ten.py (mpmath, 25 digits).\n")
        out.write("# lambdas 0.1 0.2 0.3 0.4 0.5 0.6 0.7 0.8 0.85 0.9; kind,df,x,upper\n")
        out.writelines(rows)
