#!/usr/bin/env python3
"""Dense mpmath grids over the body of the gamma, Poisson, beta, binomial and
hypergeometric laws, with the quantiles of small gamma and beta shapes:
writes tests/data/distribution_body.csv in the layout of
distribution_precision.csv (family,function,x,param1..param4,expected).

The body grids put points at the mean plus multiples of the standard
deviation, where the fast kernels change method (series, continued fraction,
Temme's expansion, TOMS 708's branches). Exact rationals for the
hypergeometric law, mpmath at 60 digits otherwise.
"""
import math
import os
import sys
from fractions import Fraction

import mpmath

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
from refdata import d, write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "tests", "data")
Z = (-6.0, -3.0, -1.7, -0.9, -0.3, 0.0, 0.2, 0.6, 1.3, 2.4, 4.0, 8.0)


def p_gamma(a, x):
    """P(a, x); mpmath's lower form gives up for large shapes, so below
    a + 1 the Kummer series x^a e^-x / Gamma(a+1) 1F1(1; a+1; x)."""
    a, x = mpmath.mpf(a), mpmath.mpf(x)
    if x > a + 1:
        return 1 - mpmath.gammainc(a, x, mpmath.inf, regularized=True)
    return mpmath.exp(a * mpmath.log(x) - x - mpmath.loggamma(a + 1)) * mpmath.hyp1f1(
        1, a + 1, x, maxterms=10**8)


def q_gamma(a, x):
    a, x = mpmath.mpf(a), mpmath.mpf(x)
    if x > a + 1:
        return mpmath.gammainc(a, x, mpmath.inf, regularized=True)
    return 1 - p_gamma(a, x)


def gamma_rows():
    out = []
    for shape in (0.05, 0.3, 0.5, 0.9, 1.0, 1.7, 4.5, 9.5, 19.9, 20.0, 33.3, 150.0, 1234.5, 1e5):
        a = d(shape)
        sd = math.sqrt(shape)
        xs = {shape * f for f in (0.01, 0.2, 0.6, 0.9, 1.0, 1.1, 1.45, 2.0, 4.0)}
        xs |= {shape + z * sd for z in Z}
        for x in sorted(v for v in xs if v > 0):
            out.append(["gamma", "lower", x, shape, 1.0, 0.0, 0.0, p_gamma(a, d(x))])
            out.append(["gamma", "upper", x, shape, 1.0, 0.0, 0.0, q_gamma(a, d(x))])
    return out


def poisson_rows():
    out = []
    for mean in (0.7, 3.0, 17.5, 40.0, 250.0, 1e4):
        m = d(mean)
        ks = sorted({int(mean + z * math.sqrt(mean)) for z in Z} - {-1} | {0})
        for k in (k for k in ks if k >= 0):
            out.append(["poisson", "lower", float(k), mean, 0.0, 0.0, 0.0, q_gamma(k + 1, m)])
            up = p_gamma(k, m) if k >= 1 else mpmath.mpf(1)
            out.append(["poisson", "upper", float(k), mean, 0.0, 0.0, 0.0, up])
    return out


def beta_rows():
    out = []
    for a, b in ((0.5, 0.5), (2.5, 7.0), (0.1, 3.0), (1.0, 40.0), (50.0, 70.0), (1e3, 2e3)):
        A, B = d(a), d(b)
        mean = a / (a + b)
        sd = math.sqrt(a * b / ((a + b) ** 2 * (a + b + 1)))
        xs = {mean + z * sd for z in Z} | {0.001, 0.2, 0.5, 0.8, 0.999}
        for x in sorted(v for v in xs if 0 < v < 1):
            X = d(x)
            out.append(["beta", "lower", x, a, b, 0.0, 0.0,
                        mpmath.betainc(A, B, 0, X, regularized=True)])
            out.append(["beta", "upper", x, a, b, 0.0, 0.0,
                        mpmath.betainc(B, A, 0, 1 - X, regularized=True)])
    return out


def binomial_sum(n, p, k, step):
    """Sum of the binomial masses from k downwards (step -1) or upwards (+1),
    by the ratio of neighbouring masses, until the terms fall below 1e-50 of
    the sum (mpmath's betainc fails to converge at n = 1e5)."""
    N, P = mpmath.mpf(n), d(p)
    term = mpmath.exp(mpmath.loggamma(N + 1) - mpmath.loggamma(k + 1) - mpmath.loggamma(N - k + 1)
                      + k * mpmath.log(P) + (N - k) * mpmath.log(1 - P))
    total, i = mpmath.mpf(0), k
    while 0 <= i <= n:
        total += term
        if step < 0:
            term *= i * (1 - P) / ((N - i + 1) * P)
        else:
            term *= (N - i) * P / ((i + 1) * (1 - P))
        i += step
        if term < total * mpmath.mpf(10) ** -50:
            break
    return total


def binomial_rows():
    out = []
    for n, p in ((20, 0.3), (200, 0.3), (1000, 0.01), (5000, 0.5), (100000, 0.2),
                 (300000, 0.5), (1000000, 0.37)):
        mean, sd = n * p, math.sqrt(n * p * (1 - p))
        ks = sorted({int(mean + z * sd) for z in Z if 0 <= mean + z * sd < n})
        for k in ks:
            out.append(["binomial", "lower", float(k), float(n), p, 0.0, 0.0,
                        binomial_sum(n, p, k, -1)])
            out.append(["binomial", "upper", float(k), float(n), p, 0.0, 0.0,
                        binomial_sum(n, p, k, +1)])
    return out


def hypergeometric_rows():
    out = []
    for N, M, n in ((60, 25, 30), (1000, 400, 150), (5000, 300, 2000), (20000, 9000, 4000)):
        lo, hi = max(0, M + n - N), min(M, n)
        total = math.comb(N, n)
        mass = [Fraction(math.comb(M, k) * math.comb(N - M, n - k), total)
                for k in range(lo, hi + 1)]
        mean = M * n / N
        sd = math.sqrt(mean * (N - M) / N * (N - n) / (N - 1))
        ks = sorted({int(mean + z * sd) for z in Z if lo <= mean + z * sd <= hi})
        for k in ks:
            low = sum(mass[: k - lo + 1], Fraction(0))
            up = sum(mass[k - lo:], Fraction(0))
            for f, v in (("lower", low), ("upper", up)):
                out.append(["hypergeometric", f, float(k), float(N), float(M), float(n), 0.0,
                            mpmath.mpf(v.numerator) / v.denominator])
    return out


def increasing_root(f, lo, hi):
    """Root of an increasing f on [lo, hi] by bisection in the logarithm."""
    lo, hi = mpmath.log(lo), mpmath.log(hi)
    for _ in range(400):
        mid = (lo + hi) / 2
        if f(mpmath.exp(mid)) < 0:
            lo = mid
        else:
            hi = mid
    return mpmath.exp((lo + hi) / 2)


def quantile_rows():
    out = []
    ps = (1e-300, 1e-20, 1e-6, 0.01, 0.3, 0.5, 0.9, 0.999)
    for shape in (0.02, 0.1, 0.3, 0.7, 2.5):
        a = d(shape)
        for p in ps:
            P = d(p)
            def f(y):
                return p_gamma(a, y) - P if p <= 0.5 else (1 - P) - q_gamma(a, y)
            q = increasing_root(f, mpmath.mpf(10) ** -20000, mpmath.mpf(10) ** 4)
            out.append(["gamma", "inv", p, shape, 1.0, 0.0, 0.0, q])
    for a, b in ((0.05, 4.0), (0.2, 0.3), (0.5, 0.5), (0.3, 8.0), (6.0, 0.15)):
        A, B = d(a), d(b)
        for p in ps:
            P = d(p)

            def f(y):
                if p <= 0.5:
                    return mpmath.betainc(A, B, 0, y, regularized=True) - P
                return (1 - P) - mpmath.betainc(B, A, 0, 1 - y, regularized=True)
            q = increasing_root(f, mpmath.mpf(10) ** -20000, mpmath.mpf(1) - mpmath.mpf(10) ** -40)
            out.append(["beta", "inv", p, a, b, 0.0, 0.0, q])
    return out


def deep_tail_rows():
    """Tails between 1e-308 and 1e-280, where the fast kernels hand over to the
    ELV routines."""
    out = [["gamma", "lower", 1.0, shape, 1.0, 0.0, 0.0, p_gamma(shape, 1)]
           for shape in (160.0, 165.0)]
    out.append(["poisson", "upper", 168.0, 1.0, 0.0, 0.0, 0.0, p_gamma(168, 1)])
    out.append(["beta", "lower", 1e-3, 100.0, 2.0, 0.0, 0.0,
                mpmath.betainc(100, 2, 0, d(1e-3), regularized=True)])
    out.append(["binomial", "upper", 150.0, 150.0, 0.01, 0.0, 0.0, d(0.01) ** 150])
    out.append(["t", "lower", -1e40, 7.0, 0.0, 0.0, 0.0, student_t_lower(-1e40, 7)])
    return out


def student_t_lower(t, n):
    """P(T <= t), t < 0: I_x(n/2, 1/2)/2 with x = n/(n + t^2)."""
    n, t = mpmath.mpf(n), d(t)
    return mpmath.betainc(n / 2, mpmath.mpf(1) / 2, 0, n / (n + t * t), regularized=True) / 2


def main():
    mpmath.mp.dps = 60
    rows = gamma_rows() + poisson_rows() + beta_rows() + binomial_rows()
    rows += hypergeometric_rows() + quantile_rows() + deep_tail_rows()
    header = "family,function,x,param1,param2,param3,param4,expected"
    write_rows(os.path.join(DATA, "distribution_body.csv"), header, rows)


if __name__ == "__main__":
    main()
