#!/usr/bin/env python3
"""Reference solutions, inverses, determinants, Cholesky factors and
eigenvalues for the value matrices, from mpmath at 50 digits.

Every matrix is made of doubles (written with 17 digits) and mpmath works on
exactly those doubles. Families: random (uniform on [-1, 1], fixed seed),
Hilbert n = 2..12, graded (rows scaled from 1e-10 to 1e10), near singular
(one row a combination of the others plus 1e-10), and for the symmetric
routines random Gram matrices, Hilbert and graded D R D; for eigenvalues
also Wilkinson W21+, repeated values, 1 by 1 and zero matrices.

Rows of tests/data/matrix_reference.csv:
    lu,name,n,cond_inf,A row-major...,b...,x...,det,inverse row-major...
    chol,name,n,cond_inf,A row-major...,L row-major (the lower factor, U = L')...,inverse row-major...
    eig,name,n,norm_inf,A row-major...,eigenvalues ascending...
Run: /usr/bin/python3 tools/reference/gen_matrix_reference.py
"""
import os
import random
import sys

import mpmath

sys.path.insert(0, os.path.dirname(__file__))
from refdata import write_rows  # noqa: E402

mpmath.mp.dps = 50
OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data", "matrix_reference.csv")
rng = random.Random(20261123)


def rand_matrix(n, m=None):
    return [[rng.uniform(-1.0, 1.0) for _ in range(m or n)] for _ in range(n)]


def hilbert(n):
    return [[1.0 / (i + j + 1) for j in range(n)] for i in range(n)]


def graded(n):
    r = rand_matrix(n)
    return [[r[i][j] * 10.0 ** (-10 + 20 * i / (n - 1)) for j in range(n)] for i in range(n)]


def near_singular(n):
    a = rand_matrix(n)
    a[n - 1] = [a[0][j] + 0.5 * a[1][j] + (1e-10 if j == 0 else 0.0) for j in range(n)]
    return a


def gram(n):
    b = rand_matrix(n + 2, n)
    return [[sum(b[k][i] * b[k][j] for k in range(n + 2)) + (1.0 if i == j else 0.0)
             for j in range(n)] for i in range(n)]


def graded_spd(n):
    g = gram(n)
    s = [10.0 ** (-5 + 10 * i / (n - 1)) for i in range(n)]
    return [[g[i][j] * s[i] * s[j] for j in range(n)] for i in range(n)]


def symmetric(n):
    r = rand_matrix(n)
    return [[r[max(i, j)][min(i, j)] for j in range(n)] for i in range(n)]


def wilkinson(n):
    h = (n - 1) // 2
    return [[float(abs(h - i)) if i == j else (1.0 if abs(i - j) == 1 else 0.0)
             for j in range(n)] for i in range(n)]


def flat(a):
    return [mpmath.mpf(x) for row in a for x in row]


def norm_inf(a):
    return max(sum(abs(x) for x in row) for row in a.tolist())


def lu_row(name, a):
    n = len(a)
    A = mpmath.matrix(a)
    b = [rng.uniform(-1.0, 1.0) for _ in range(n)]
    x = mpmath.lu_solve(A, mpmath.matrix(b))
    inv = A ** -1
    cond = norm_inf(A) * norm_inf(inv)
    return (["lu", name, str(n), cond] + flat(a) + b + list(x) + [mpmath.det(A)]
            + list(inv))


def chol_row(name, a):
    n = len(a)
    A = mpmath.matrix(a)
    L = mpmath.cholesky(A)
    inv = A ** -1
    cond = norm_inf(A) * norm_inf(inv)
    return ["chol", name, str(n), cond] + flat(a) + list(L) + list(inv)


def eig_row(name, a):
    n = len(a)
    A = mpmath.matrix(a)
    values = sorted(mpmath.eigsy(A, eigvals_only=True)) if n > 0 else []
    return ["eig", name, str(n), norm_inf(A)] + flat(a) + values


def main():
    rows = []
    for n in (1, 3, 5, 8):
        rows.append(lu_row("random%d" % n, rand_matrix(n)))
    for n in range(2, 13):
        rows.append(lu_row("hilbert%d" % n, hilbert(n)))
    rows.append(lu_row("graded6", graded(6)))
    rows.append(lu_row("graded9", graded(9)))
    rows.append(lu_row("near_singular5", near_singular(5)))
    for n in (1, 4, 9):
        rows.append(chol_row("gram%d" % n, gram(n)))
    for n in range(2, 13):
        rows.append(chol_row("hilbert%d" % n, hilbert(n)))
    rows.append(chol_row("graded7", graded_spd(7)))
    for n in (21, 25):
        rows.append(eig_row("wilkinson%d" % n, wilkinson(n)))
    rows.append(eig_row("repeated5", [[2, 1, 0, 0, 0], [1, 2, 0, 0, 0], [0, 0, 3, 0, 0],
                                      [0, 0, 0, 1, 0], [0, 0, 0, 0, 3]]))
    rows.append(eig_row("one", [[-2.5]]))
    rows.append(eig_row("zero4", [[0.0] * 4 for _ in range(4)]))
    rows.append(eig_row("graded7", graded_spd(7)))
    rows.append(eig_row("symmetric12", symmetric(12)))
    rows.append(eig_row("hilbert8", hilbert(8)))
    write_rows(OUT, "lu,name,n,cond,A,b,x,det,inverse | chol,name,n,cond,A,U,inverse | "
               "eig,name,n,norm,A,values", rows)


if __name__ == "__main__":
    main()
