"""Exact least squares, in mpmath at 50 digits, of an ill-conditioned
polynomial fit: x = 1e6 + 100 U(0, 1), n = 50, y quadratic in
t = (x - 1e6) / 100 plus noise, regressed on raw powers of x.

Run: python3 tools/reference/gen_curve_fit_ill.py > tests/data/curve_fit_ill.csv

Rows: x,<50 values>; y,<50 values> (the doubles the fit is given, written
with 17 digits so that they read back exactly); then for degree 1 and 2
(with the intercept): fit<d>,<d + 1 coefficients>,<R^2>,<sigma>; and
fitted2,<the 50 fitted values of the quadratic>. Every power of x is taken
exactly from the given double.
"""
import random

import mpmath as mp

mp.mp.dps = 50
rng = random.Random(20261123)
n = 50
xs = [1e6 + 100.0 * rng.random() for _ in range(n)]
ys = []
for x in xs:
    t = (x - 1e6) / 100.0
    ys.append(3.0 + 2.0 * t - 5.0 * t * t + 0.1 * rng.gauss(0.0, 1.0))


def fit(degree):
    X = mp.matrix(n, degree + 1)
    for i, x in enumerate(xs):
        for j in range(degree + 1):
            X[i, j] = mp.mpf(x) ** j
    Y = mp.matrix([mp.mpf(y) for y in ys])
    beta, _ = mp.qr_solve(X, Y)
    fitted = [sum(X[i, j] * beta[j] for j in range(degree + 1)) for i in range(n)]
    rss = sum((Y[i] - fitted[i]) ** 2 for i in range(n))
    mean = sum(Y) / n
    tss = sum((Y[i] - mean) ** 2 for i in range(n))
    sigma = mp.sqrt(rss / (n - degree - 1))
    return [beta[j] for j in range(degree + 1)], 1 - rss / tss, sigma, fitted


def row(name, values):
    print(",".join([name] + [mp.nstr(v, 17, min_fixed=1, max_fixed=0) if isinstance(v, mp.mpf)
                             else repr(v) for v in values]))


row("x", xs)
row("y", ys)
for d in (1, 2):
    beta, r2, sigma, fitted = fit(d)
    row("fit%d" % d, beta + [r2, sigma])
    if d == 2:
        row("fitted2", fitted)
