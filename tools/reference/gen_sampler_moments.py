#!/usr/bin/env python3
"""Means and variances of the sampler's families at the parameters the
goodness-of-fit tests draw from, evaluated in mpmath at 60 digits from the
standard moment formulas (Johnson, Kotz and Balakrishnan). NaN where the
moment is not tested (it does not exist, or the family has none worth
testing).

Rows: family,continuous,draws,p1,p2,p3,mean,variance. The parameters are in
the order of the sampler call (unused ones 0); the flag of the negative
binomial and geometric families is 1 for counting trials, 0 for failures.
Writes tests/data/sampler_families.csv.
Run: /usr/bin/python3 tools/reference/gen_sampler_moments.py
"""
import os
import sys

import mpmath
from mpmath import euler, exp, gamma, mpf, pi, sin, sqrt

sys.path.insert(0, os.path.dirname(__file__))
from refdata import d, write_rows  # noqa: E402

OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data",
                   "sampler_families.csv")
DRAWS = 100000
NONE = (None, None)


def tukey_lambda_variance(lam):
    return 2 / lam**2 * (1 / (1 + 2 * lam) - gamma(lam + 1)**2 / gamma(2 * lam + 2))


def continuous():
    rows = []

    def add(family, params, moments, draws=DRAWS):
        rows.append((family, 1, draws, params, moments))

    add("normal", (1, 2), (d(1), d(2)**2))
    add("uniform", (-1, 3), (d(1), d(4)**2 / 12))
    add("exponential", (2, 1), (d(1) + 2, d(2)**2))
    add("cauchy", (1, 0.5), NONE)
    add("laplace", (-2, 3), (d(-2), 2 * d(3)**2))
    add("largest_extreme_value", (1, 2), (1 + 2 * euler, pi**2 * 4 / 6))
    add("smallest_extreme_value", (1, 2), (1 - 2 * euler, pi**2 * 4 / 6))
    add("logistic", (3, 0.5), (d(3), pi**2 * d(0.5)**2 / 3))
    mu, s = d(0.5), d(0.2)
    m1, m2 = pi * s / sin(pi * s), 2 * pi * s / sin(2 * pi * s)
    add("loglogistic", (0.5, 0.2, 1), (1 + exp(mu) * m1, exp(2 * mu) * (m2 - m1**2)))
    mu, sigma = d(0.5), d(0.4)
    add("lognormal", (0.5, 0.4, 2),
        (2 + exp(mu + sigma**2 / 2), (exp(sigma**2) - 1) * exp(2 * mu + sigma**2)))
    add("lambda", (0.14, 1, 2), (d(1), d(2)**2 * tukey_lambda_variance(d(0.14))))
    add("triangular", (0, 1, 4), (mpf(5) / 3, mpf(0 + 1 + 16 - 0 - 0 - 4) / 18))
    k, scale = d(1.5), d(2)
    g1, g2 = gamma(1 + 1 / k), gamma(1 + 2 / k)
    add("weibull", (1.5, 2, 0.5), (d(0.5) + scale * g1, scale**2 * (g2 - g1**2)))
    for shape in (0.01, 0.3, 0.999, 1.0, 1.001, 2.5, 3.999, 4.0, 7.5, 1e4):
        add("gamma", (shape, 1.5, 0), (d(shape) * d(1.5), d(shape) * d(1.5)**2))
    add("chisq", (3,), (mpf(3), mpf(6)))
    for a, b in ((2, 3), (3, 2), (5, 5), (0.5, 0.5), (0.05, 0.5), (5, 0.3), (0.3, 5), (1, 1),
                 (0.01, 2), (0.5, 0.2), (40, 0.9)):
        a, b = d(a), d(b)
        add("beta", (a, b), (a / (a + b), a * b / ((a + b)**2 * (a + b + 1))))
    d1, d2 = mpf(5), mpf(10)
    add("F", (5, 10, 0), (d2 / (d2 - 2), 2 * d2**2 * (d1 + d2 - 2) / (d1 * (d2 - 2)**2 * (d2 - 4))))
    add("F", (0.5, 3, 0), NONE)
    add("t", (6, 0), (mpf(0), mpf(6) / 4))
    # Noncentral t is drawn by inversion through a root search: fewer draws.
    nu, delta = mpf(8), mpf(1.5)
    mean = delta * sqrt(nu / 2) * gamma((nu - 1) / 2) / gamma(nu / 2)
    add("t", (8, 1.5), (mean, nu * (1 + delta**2) / (nu - 2) - mean**2), 5000)
    add("t", (1, 0), NONE)
    return rows


def discrete():
    rows = []

    def add(family, params, moments, draws=DRAWS):
        rows.append((family, 0, draws, params, moments))

    add("bernoulli", (0.3,), (d(0.3), d(0.3) * (1 - d(0.3))))
    for n, p in ((20, 0.3), (50, 0.002), (30, 0.999)):
        add("binomial", (n, p), (n * d(p), n * d(p) * (1 - d(p))))
    for lam in (3, 0.01):
        add("poisson", (lam,), (d(lam), d(lam)))
    # Inversion at a huge mean costs tens of microseconds a draw.
    add("poisson", (1e6,), (d(1e6), d(1e6)), 20000)
    k, p = mpf(3), d(0.4)
    add("negative_binomial", (3, 0.4, 1), (k / p, k * (1 - p) / p**2))
    k, p = mpf(5), d(0.9)
    add("negative_binomial", (5, 0.9, 0), (k * (1 - p) / p, k * (1 - p) / p**2))
    p = d(0.2)
    add("geometric", (0.2, 1), (1 / p, (1 - p) / p**2))
    p = d(0.02)
    add("geometric", (0.02, 0), ((1 - p) / p, (1 - p) / p**2))
    N, K, n = mpf(50), mpf(20), mpf(10)
    add("hypergeometric", (50, 20, 10),
        (n * K / N, n * K / N * (1 - K / N) * (N - n) / (N - 1)))
    a, b = mpf(-3), mpf(7)
    add("integer_uniform", (-3, 7), ((a + b) / 2, ((b - a + 1)**2 - 1) / 12))
    return rows


def main():
    out = []
    for family, flag, draws, params, (mean, variance) in continuous() + discrete():
        params = [float(x) for x in params] + [0.0] * (3 - len(params))
        out.append([family, flag, draws] + params + [mean, variance])
    write_rows(OUT, "family,continuous,draws,p1,p2,p3,mean,variance", out)


if __name__ == "__main__":
    main()
