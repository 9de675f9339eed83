#!/usr/bin/env python3
"""Reference values for the exported distribution families: a few points per
family and function, with asymmetric parameters, so that a wrong kernel or a
wrong order of arguments cannot pass. Both tails are computed exactly; the
upper tail of a discrete law includes the point.

Writes tests/data/exported_families.csv with rows
    family,function,x,param1,param2,param3,expected
(function: pdf, lower, upper, inv). Run with python3-mpmath.
"""
import os
import sys

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import d, write_rows  # noqa: E402

mpmath.mp.dps = 50
OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data", "exported_families.csv")


def norm_cdf(z):
    return mpmath.ncdf(z)


def chi2_cdf(x, k):
    return mpmath.gammainc(k / 2, 0, x / 2, regularized=True)


def chi2_sf(x, k):
    return mpmath.gammainc(k / 2, x / 2, mpmath.inf, regularized=True)


def poisson_mixture(L, term):
    """sum_j e^-L L^j / j! term(j), to full precision."""
    total = mpf(0)
    j = 0
    w = mpmath.exp(-L)
    while True:
        t = w * term(j)
        total += t
        if j > L and t < total * mpf(10) ** -45:
            return total
        j += 1
        w *= L / j


def ncx2(x, k, lam, upper):
    f = chi2_sf if upper else chi2_cdf
    return poisson_mixture(lam / 2, lambda j: f(x, k + 2 * j))


def beta_cdf(x, a, b, upper=False):
    if upper:
        return mpmath.betainc(a, b, x, 1, regularized=True)
    return mpmath.betainc(a, b, 0, x, regularized=True)


def ncf(x, d1, d2, lam, upper):
    y = d1 * x / (d1 * x + d2)
    return poisson_mixture(lam / 2, lambda j: beta_cdf(y, d1 / 2 + j, d2 / 2, upper))


def nct_lower(t, df, delta):
    # P(T <= t) = integral over the chi distribution of Phi(t sqrt(u/df) - delta).
    def integrand(u):
        return norm_cdf(t * mpmath.sqrt(u / df) - delta) * mpmath.exp(
            (df / 2 - 1) * mpmath.log(u) - u / 2 - (df / 2) * mpmath.log(2) - mpmath.loggamma(df / 2))
    return mpmath.quad(integrand, [0, df / 2, df, 2 * df, 4 * df + 100, mpmath.inf])


def t_cdf(t, df, upper=False):
    x = df / (df + t * t)
    half = beta_cdf(x, df / 2, mpf(1) / 2) / 2
    if (t > 0) != upper:
        return 1 - half
    return half


def root(f, target, bracket):
    """The root of an increasing f(x) = target inside a bracket: Illinois
    steps, checked, with bisection as the fallback when they stall."""
    lo, hi = mpf(bracket[0]), mpf(bracket[1])
    x = mpmath.findroot(lambda x: f(x) - target, (lo, hi), solver="illinois",
                        tol=mpf(10) ** -40, verify=False)
    if lo < x < hi and abs(f(x) - target) <= abs(target) * mpf(10) ** -30:
        return x
    return bisect(lambda x: f(x) - target, lo, hi, steps=200)


def bisect(f, lo, hi, steps=220):
    """Plain bisection for an increasing f with a root in (lo, hi)."""
    for _ in range(steps):
        mid = (lo + hi) / 2
        if f(mid) < 0:
            lo = mid
        else:
            hi = mid
    return (lo + hi) / 2


def binom_pmf(k, n, p):
    return mpmath.binomial(n, k) * p ** k * (1 - p) ** (n - k)


def hyper_pmf(k, N, M, n):
    return mpmath.binomial(M, k) * mpmath.binomial(N - M, n - k) / mpmath.binomial(N, n)


def discrete_rows(family, params, pmf, support, xs, ps):
    rows = []
    p3 = list(params) + [0.0] * (3 - len(params))
    for x in xs:
        rows.append([family, "pdf", float(x)] + p3 + [pmf(x) if x in support else mpf(0)])
        rows.append([family, "lower", float(x)] + p3 + [sum(pmf(k) for k in support if k <= x)])
        rows.append([family, "upper", float(x)] + p3 + [sum(pmf(k) for k in support if k >= x)])
    for p in ps:
        acc = mpf(0)
        q = None
        for k in support:
            acc += pmf(k)
            if acc >= d(p) * (1 - mpf(10) ** -40):
                q = k
                break
        rows.append([family, "inv", float(p)] + p3 + [mpf(q)])
    return rows


def continuous_rows(family, params, pdf, lower, upper, inv, xs, ps):
    rows = []
    p3 = list(params) + [0.0] * (3 - len(params))
    for x in xs:
        X = d(x)
        rows += [[family, "pdf", float(x)] + p3 + [pdf(X)],
                 [family, "lower", float(x)] + p3 + [lower(X)],
                 [family, "upper", float(x)] + p3 + [upper(X)]]
    for p in ps:
        rows.append([family, "inv", float(p)] + p3 + [inv(d(p))])
    return rows


def main():
    R = []
    ps = [1e-10, 0.01, 0.3, 0.5, 0.8, 0.999]
    # Normal(mean, sigma)
    m, s = d(1.5), d(2.0)
    R += continuous_rows("Normal", (1.5, 2.0), lambda x: mpmath.npdf(x, m, s),
                         lambda x: norm_cdf((x - m) / s), lambda x: norm_cdf(-(x - m) / s),
                         lambda p: m + s * mpmath.sqrt(2) * mpmath.erfinv(2 * p - 1),
                         [-20.0, -1.0, 1.5, 2.0, 30.0], ps)
    # LogNormal(location, scale, threshold)
    L, S, T = d(0.5), d(0.75), d(1.0)
    R += continuous_rows("LogNormal", (0.5, 0.75, 1.0),
                         lambda x: mpmath.npdf(mpmath.log(x - T), L, S) / (x - T),
                         lambda x: norm_cdf((mpmath.log(x - T) - L) / S),
                         lambda x: norm_cdf(-(mpmath.log(x - T) - L) / S),
                         lambda p: T + mpmath.exp(L + S * mpmath.sqrt(2) * mpmath.erfinv(2 * p - 1)),
                         [1.01, 2.0, 3.5, 100.0], ps)
    # HalfNormal(scale, location)
    S, L = d(2.0), d(-1.0)
    R += continuous_rows("HalfNormal", (2.0, -1.0), lambda x: 2 * mpmath.npdf(x, L, S),
                         lambda x: 2 * norm_cdf((x - L) / S) - 1,
                         lambda x: 2 * norm_cdf(-(x - L) / S),
                         lambda p: L + S * mpmath.sqrt(2) * mpmath.erfinv(p),
                         [-0.5, 0.0, 3.0, 9.0], [0.01, 0.3, 0.5, 0.8, 0.999])
    # Exponential(scale, threshold)
    S, T = d(3.0), d(0.5)
    R += continuous_rows("Exponential", (3.0, 0.5), lambda x: mpmath.exp(-(x - T) / S) / S,
                         lambda x: -mpmath.expm1(-(x - T) / S), lambda x: mpmath.exp(-(x - T) / S),
                         lambda p: T - S * mpmath.log1p(-p), [0.5000001, 1.0, 4.0, 200.0], ps)
    # Weibull(shape, scale, threshold)
    k, S, T = d(1.7), d(2.5), d(-1.0)
    z = lambda x: (x - T) / S  # noqa: E731
    R += continuous_rows("Weibull", (1.7, 2.5, -1.0),
                         lambda x: k / S * z(x) ** (k - 1) * mpmath.exp(-z(x) ** k),
                         lambda x: -mpmath.expm1(-z(x) ** k), lambda x: mpmath.exp(-z(x) ** k),
                         lambda p: T + S * (-mpmath.log1p(-p)) ** (1 / k), [-0.5, 1.0, 4.0, 12.0], ps)
    # LargestExtremeValue(location, scale)
    L, S = d(1.0), d(2.0)
    lev = lambda x: mpmath.exp(-mpmath.exp(-(x - L) / S))  # noqa: E731
    R += continuous_rows("LargestExtremeValue", (1.0, 2.0),
                         lambda x: mpmath.exp(-(x - L) / S) * lev(x) / S, lev,
                         lambda x: -mpmath.expm1(-mpmath.exp(-(x - L) / S)),
                         lambda p: L - S * mpmath.log(-mpmath.log(p)), [-5.0, 0.0, 3.0, 40.0], ps)
    # SmallestExtremeValue(location, scale)
    sev_up = lambda x: mpmath.exp(-mpmath.exp((x - L) / S))  # noqa: E731
    R += continuous_rows("SmallestExtremeValue", (1.0, 2.0),
                         lambda x: mpmath.exp((x - L) / S) * sev_up(x) / S,
                         lambda x: -mpmath.expm1(-mpmath.exp((x - L) / S)), sev_up,
                         lambda p: L + S * mpmath.log(-mpmath.log1p(-p)), [-40.0, -3.0, 0.0, 5.0], ps)
    # Laplace(location, scale)
    L, S = d(-2.0), d(0.5)
    R += continuous_rows("Laplace", (-2.0, 0.5), lambda x: mpmath.exp(-abs(x - L) / S) / (2 * S),
                         lambda x: mpmath.exp((x - L) / S) / 2 if x < L else 1 - mpmath.exp(-(x - L) / S) / 2,
                         lambda x: mpmath.exp(-(x - L) / S) / 2 if x > L else 1 - mpmath.exp((x - L) / S) / 2,
                         lambda p: L + S * mpmath.log(2 * p) if p <= 0.5 else L - S * mpmath.log(2 - 2 * p),
                         [-9.0, -2.5, -1.0, 6.0], ps)
    # Gamma(shape, scale, threshold)
    a, S, T = d(2.5), d(1.5), d(1.0)
    R += continuous_rows("Gamma", (2.5, 1.5, 1.0),
                         lambda x: ((x - T) / S) ** (a - 1) * mpmath.exp(-(x - T) / S) / mpmath.gamma(a) / S,
                         lambda x: mpmath.gammainc(a, 0, (x - T) / S, regularized=True),
                         lambda x: mpmath.gammainc(a, (x - T) / S, mpmath.inf, regularized=True),
                         lambda p: T + S * root(lambda y: mpmath.gammainc(a, 0, y, regularized=True), p, (1e-10, 200)),
                         [1.1, 3.0, 6.0, 60.0], [0.01, 0.3, 0.5, 0.8, 0.999])
    # Beta(a, b)
    A, B = d(2.0), d(5.0)
    R += continuous_rows("Beta", (2.0, 5.0), lambda x: x ** (A - 1) * (1 - x) ** (B - 1) / mpmath.beta(A, B),
                         lambda x: beta_cdf(x, A, B), lambda x: beta_cdf(x, A, B, True),
                         lambda p: root(lambda y: beta_cdf(y, A, B), p, (1e-12, 1 - 1e-12)),
                         [1e-5, 0.1, 0.3, 0.9], [0.01, 0.3, 0.5, 0.8, 0.99])
    # ChiSq(df, noncentrality): central and noncentral
    for df, lam in ((4.0, 0.0), (3.0, 2.5)):
        K, LM = d(df), d(lam)
        R += continuous_rows("ChiSq", (df, lam),
                             lambda x, K=K: x ** (K / 2 - 1) * mpmath.exp(-x / 2) / (2 ** (K / 2) * mpmath.gamma(K / 2)),
                             lambda x, K=K, LM=LM: ncx2(x, K, LM, False),
                             lambda x, K=K, LM=LM: ncx2(x, K, LM, True),
                             lambda p, K=K, LM=LM: root(lambda y: ncx2(y, K, LM, False), p, (1e-8, 100)),
                             [0.5, 3.0, 10.0, 60.0], [0.01, 0.3, 0.5, 0.8, 0.999])
    # F(df1, df2, noncentrality)
    for d1, d2, lam in ((3.0, 12.0, 0.0), (4.0, 9.0, 3.0)):
        D1, D2, LM = d(d1), d(d2), d(lam)
        R += continuous_rows("F", (d1, d2, lam),
                             lambda x, D1=D1, D2=D2: mpmath.sqrt((D1 * x) ** D1 * D2 ** D2 / (D1 * x + D2) ** (D1 + D2)) / (x * mpmath.beta(D1 / 2, D2 / 2)),
                             lambda x, D1=D1, D2=D2, LM=LM: ncf(x, D1, D2, LM, False),
                             lambda x, D1=D1, D2=D2, LM=LM: ncf(x, D1, D2, LM, True),
                             lambda p, D1=D1, D2=D2, LM=LM: root(lambda y: ncf(y, D1, D2, LM, False), p, (1e-8, 200)),
                             [0.2, 1.0, 3.0, 25.0], [0.01, 0.3, 0.5, 0.8, 0.99])
    # T(df, noncentrality): central (closed form) and noncentral (integral)
    DF = d(7.0)
    R += continuous_rows("T", (7.0, 0.0),
                         lambda x: mpmath.gamma((DF + 1) / 2) / (mpmath.sqrt(DF * mpmath.pi) * mpmath.gamma(DF / 2)) * (1 + x * x / DF) ** (-(DF + 1) / 2),
                         lambda x: t_cdf(x, DF), lambda x: t_cdf(x, DF, True),
                         lambda p: root(lambda y: t_cdf(y, DF), p, (-200, 200)),
                         [-30.0, -1.5, 0.5, 4.0], [1e-10, 0.01, 0.3, 0.8, 0.999])
    DF, DL = d(9.0), d(1.25)
    R += continuous_rows("T", (9.0, 1.25),
                         lambda x: mpmath.diff(lambda y: nct_lower(y, DF, DL), x),
                         lambda x: nct_lower(x, DF, DL), lambda x: 1 - nct_lower(x, DF, DL),
                         lambda p: root(lambda y: nct_lower(y, DF, DL), p, (-10, 20)),
                         [-1.0, 0.5, 2.0, 5.0], [0.01, 0.3, 0.8, 0.99])
    # Lambda(lambda, location, scale): Q(p) = (p^l - (1-p)^l)/l
    for lam in (0.14,):
        LM, L, S = d(lam), d(1.0), d(2.0)

        def q(p, LM=LM):
            return (p ** LM - (1 - p) ** LM) / LM

        def cdf_at(x, LM=LM, L=L, S=S):
            z = (x - L) / S
            return bisect(lambda p: q(p) - z, mpf(0), mpf(1))

        R += continuous_rows("Lambda", (lam, 1.0, 2.0),
                             lambda x, LM=LM, L=L, S=S, c=cdf_at: 1 / (S * (c(x) ** (LM - 1) + (1 - c(x)) ** (LM - 1))),
                             cdf_at, lambda x, c=cdf_at: 1 - c(x),
                             lambda p, L=L, S=S, q=q: L + S * q(p), [-2.0, 0.5, 1.0, 4.0], [0.01, 0.3, 0.5, 0.9])
    # Discrete laws
    n, p = 12, d(0.3)
    R += discrete_rows("Binomial", (12.0, 0.3), lambda k: binom_pmf(k, n, p), list(range(0, 13)),
                       [0.0, 2.0, 4.0, 9.0, 12.0], [0.01, 0.3, 0.5, 0.8, 0.99])
    mu = d(3.5)
    R += discrete_rows("Poisson", (3.5,), lambda k: mpmath.exp(-mu) * mu ** k / mpmath.factorial(k),
                       list(range(0, 80)), [0.0, 2.0, 5.0, 14.0], [0.01, 0.3, 0.5, 0.8, 0.999])
    N, M, nn = 40, 15, 10
    R += discrete_rows("Hypergeometric", (40.0, 15.0, 10.0), lambda k: hyper_pmf(k, N, M, nn),
                       list(range(0, 11)), [0.0, 2.0, 4.0, 8.0], [0.01, 0.3, 0.5, 0.8, 0.99])
    pr, r = d(0.4), 3
    R += discrete_rows("NegBinomial", (0.4, 3.0),
                       lambda k: mpmath.binomial(k - 1, r - 1) * pr ** r * (1 - pr) ** (k - r),
                       list(range(3, 300)), [3.0, 5.0, 9.0, 20.0], [0.01, 0.3, 0.5, 0.8, 0.99])
    pg = d(0.25)
    R += discrete_rows("Geometric", (0.25,), lambda k: pg * (1 - pg) ** (k - 1), list(range(1, 400)),
                       [1.0, 2.0, 5.0, 20.0], [0.01, 0.3, 0.5, 0.8, 0.99])
    R += discrete_rows("IntegerUniform", (-2.0, 7.0), lambda k: mpf(1) / 10, list(range(-2, 8)),
                       [-2.0, 0.0, 3.0, 7.0], [0.07, 0.25, 0.55, 0.82, 0.99])
    write_rows(OUT, "family,function,x,param1,param2,param3,expected", R)
    print("wrote", len(R), "rows")


if __name__ == "__main__":
    main()
