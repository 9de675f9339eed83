#!/usr/bin/env python3
"""Reference values for the distribution kernels on the ELV routines and the
discrete kernels: densities or masses, both tails each computed in its own
right, and quantiles, over parameters that reach every branch of the kernels.

Writes tests/data/kernels.csv with rows
    family,function,x,param1,param2,param3,param4,expected
function: pdf, lower, upper, inv. Discrete upper tails are P(X >= x);
discrete quantiles are the smallest k with P(X <= k) >= p, for p kept away
from the jumps of the distribution function.

Writes tests/data/kernels_pvalues.csv with rows
    family,x,n_or_N,p_or_M,n_or_0,alternative,expected
for the two-sided binomial (likelihood-ratio ordering) and hypergeometric
(Fisher probability ordering) P-values, by enumeration of all outcomes in
exact rational arithmetic (Fractions of the double inputs); cases whose
ordering has a near-tie that is not an exact tie are left out.
Run: /usr/bin/python3 tools/reference/gen_kernels.py
"""
import math
import os
import sys
from fractions import Fraction

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import d, write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")

PS = [1e-10, 1e-6, 1e-3, 0.01, 0.1, 0.25, 0.4, 0.5, 0.6, 0.75, 0.9, 0.99, 0.999, 1 - 1e-6,
      1 - 1e-10]


def solve_increasing(f, lo, hi, logscale=False):
    """Root of an increasing f on [lo, hi] by bisection to 30 digits."""
    lo, hi = mpf(lo), mpf(hi)
    for _ in range(400):
        mid = mpmath.sqrt(lo * hi) if logscale else (lo + hi) / 2
        if f(mid) < 0:
            lo = mid
        else:
            hi = mid
        if hi - lo <= abs(hi) * mpf(10) ** -30:
            break
    return (lo + hi) / 2


def rows_for(family, params, xs, ps, pdf, lower, upper, inv):
    p4 = [float(v) for v in params] + [0.0] * (4 - len(params))
    out = []
    for x in xs:
        X = d(x)
        if pdf is not None:
            out.append([family, "pdf", float(x)] + p4 + [pdf(X)])
        out.append([family, "lower", float(x)] + p4 + [lower(X)])
        out.append([family, "upper", float(x)] + p4 + [upper(X)])
    for p in ps:
        q = inv(d(p))
        # Quantiles below the ELV underflow limit come back as 0 (tested apart).
        if q is not None and not (0 < abs(q) < mpf("2.3e-288")):
            out.append([family, "inv", float(p)] + p4 + [q])
    return out


# --- continuous ------------------------------------------------------------

def exponential(scale, thr):
    s, t = d(scale), d(thr)

    def z(x):
        return (x - t) / s
    xs = [thr + scale * v for v in (1e-12, 1e-6, 5e-4, 0.0005003, 0.01, 0.5, 1, 3, 30, 700)]
    return rows_for("exponential", [scale, thr], xs, PS,
                    lambda x: mpmath.exp(-z(x)) / s,
                    lambda x: -mpmath.expm1(-z(x)),
                    lambda x: mpmath.exp(-z(x)),
                    lambda p: t - s * mpmath.log1p(-p))


def lev(loc, scale, family="lev"):
    m, s = d(loc), d(scale)
    sign = 1 if family == "lev" else -1

    def z(x):
        return sign * (x - m) / s if family == "lev" else (-x + m) / s

    xs = [loc + sign * scale * v for v in (-3.5, -2, -1, -0.2, 0, 0.3, 1, 4, 10, 30, 300)]
    lo = lambda x: mpmath.exp(-mpmath.exp(-z(x)))  # noqa: E731
    up = lambda x: -mpmath.expm1(-mpmath.exp(-z(x)))  # noqa: E731
    if family == "lev":
        inv = lambda p: m - s * mpmath.log(-mpmath.log(p))  # noqa: E731
        return rows_for(family, [loc, scale], xs, PS,
                        lambda x: mpmath.exp(-z(x) - mpmath.exp(-z(x))) / s, lo, up, inv)
    inv = lambda p: m + s * mpmath.log(-mpmath.log1p(-p))  # noqa: E731
    return rows_for(family, [loc, scale], xs, PS,
                    lambda x: mpmath.exp(-z(x) - mpmath.exp(-z(x))) / s, up, lo, inv)


def weibull(shape, scale, thr):
    k, s, t = d(shape), d(scale), d(thr)

    def w(x):
        return ((x - t) / s) ** k
    xs = [thr + scale * v for v in (1e-8, 1e-3, 0.1, 0.5, 1, 2, 5, 20)]
    return rows_for("weibull", [shape, scale, thr], xs, PS[:-1],
                    lambda x: k / s * ((x - t) / s) ** (k - 1) * mpmath.exp(-w(x)),
                    lambda x: -mpmath.expm1(-w(x)),
                    lambda x: mpmath.exp(-w(x)),
                    lambda p: t + s * (-mpmath.log1p(-p)) ** (1 / k))


def laplace(loc, scale):
    m, s = d(loc), d(scale)
    xs = [loc + scale * v for v in (-700, -30, -2, -1e-9, 0.3, 1e-7, 1, 5, 40)]

    def low(x):
        zz = (x - m) / s
        return mpmath.exp(zz) / 2 if zz < 0 else 1 - mpmath.exp(-zz) / 2
    return rows_for("laplace", [loc, scale], xs, PS,
                    lambda x: mpmath.exp(-abs(x - m) / s) / (2 * s),
                    low, lambda x: low(2 * m - x),
                    lambda p: m + s * (mpmath.log(2 * p) if p <= 0.5 else -mpmath.log(2 - 2 * p)))


def tukey(lam, loc, scale):
    L, m, s = d(lam), d(loc), d(scale)

    def q(p):
        if L == 0:
            return mpmath.log(p / (1 - p))
        return (p ** L - (1 - p) ** L) / L

    def cdf(x):
        zz = (x - m) / s
        if L > 0 and zz <= -1 / L:
            return mpf(0)
        if L > 0 and zz >= 1 / L:
            return mpf(1)
        if L == 0:
            return 1 / (1 + mpmath.exp(-zz))
        return solve_increasing(lambda p: q(p) - zz, 0, 1)

    def pdf(x):
        p = cdf(x)
        if p in (0, 1):
            return mpf(0)
        if L == 0:
            return p * (1 - p) if s == 1 else None
        return 1 / (s * (p ** (L - 1) + (1 - p) ** (L - 1)))

    width = 1 / lam if lam > 0 else 6.0
    xs = [loc + scale * width * v for v in (-1.5, -0.9, -0.5, -0.1, 0.2, 0.6, 0.97, 1.3)]
    return rows_for("lambda", [lam, loc, scale], xs, [p for p in PS if 1e-6 <= p <= 1 - 1e-6],
                    pdf, cdf, lambda x: cdf(2 * m - x), lambda p: m + s * q(p))


def gamma_family(shape, scale, thr):
    a, s, t = d(shape), d(scale), d(thr)

    def z(x):
        return (x - t) / s
    xs = [thr + scale * v * shape for v in (1e-6, 0.01, 0.3, 0.8, 1, 1.2, 3, 10)]
    return rows_for("gamma", [shape, scale, thr], xs, PS,
                    lambda x: mpmath.exp(-z(x) + (a - 1) * mpmath.log(z(x)) - mpmath.loggamma(a)) / s,
                    lambda x: mpmath.gammainc(a, 0, z(x), regularized=True),
                    lambda x: mpmath.gammainc(a, z(x), mpmath.inf, regularized=True),
                    lambda p: t + s * gamma_quantile(a, p))


def gamma_quantile(a, p):
    return solve_increasing(lambda y: mpmath.gammainc(a, 0, y, regularized=True) - p,
                            mpf(10) ** -3000, a + 50 * mpmath.sqrt(a) + 800, logscale=True)


def ncchi2(x, df, lam, upper):
    # Poisson mixture of central chi-square tails, summed from the largest weight.
    h = lam / 2
    j0 = int(mpmath.floor(h))
    total = mpf(0)

    def term(j):
        w = mpmath.exp(-h + j * mpmath.log(h) - mpmath.loggamma(j + 1)) if h > 0 else mpf(j == 0)
        if upper:
            return w * mpmath.gammainc(df / 2 + j, x / 2, mpmath.inf, regularized=True)
        return w * mpmath.gammainc(df / 2 + j, 0, x / 2, regularized=True)
    for rng in (range(j0, j0 + 100000), range(j0 - 1, -1, -1)):
        for j in rng:
            t = term(j)
            total += t
            if t < total * mpf(10) ** -30 and abs(j - j0) > 5:
                break
    return total


def chisq(df, nc):
    k, L = d(df), d(nc)
    mean = df + nc
    xs = [mean * v for v in (1e-4, 0.05, 0.5, 1, 2, 5)]
    if nc == 0:
        pdf = lambda x: mpmath.exp(-x / 2 + (k / 2 - 1) * mpmath.log(x) - k / 2 * mpmath.log(2)  # noqa: E731
                                   - mpmath.loggamma(k / 2))
        inv = lambda p: 2 * gamma_quantile(k / 2, p)  # noqa: E731
        ps = PS
    else:
        pdf = None
        inv = lambda p: solve_increasing(lambda y: ncchi2(y, k, L, False) - p,  # noqa: E731
                                         mpf(1e-3), 10 * mean + 100, logscale=True)
        ps = [0.01, 0.5, 0.9]
    return rows_for("chisq", [df, nc], xs, ps, pdf,
                    lambda x: ncchi2(x, k, L, False), lambda x: ncchi2(x, k, L, True), inv)


def normal(mean, sigma):
    m, s = d(mean), d(sigma)
    xs = [mean + sigma * v for v in (-35, -20, -5, -1, -1e-8, 0, 0.5, 3, 8, 30)]
    return rows_for("normal", [mean, sigma], xs, PS + [1e-200, 1e-120],
                    lambda x: mpmath.npdf(x, m, s),
                    lambda x: mpmath.ncdf(x, m, s),
                    lambda x: mpmath.ncdf(-x, -m, s),
                    lambda p: m + s * mpmath.sqrt(2) * mpmath.erfinv(2 * p - 1)
                    if p > 1e-30 else m + s * norm_ppf_small(p))


def norm_ppf_small(p):
    return -solve_increasing(lambda z: p - mpmath.ncdf(-z), 5, 38)


def lognormal(loc, scale, thr):
    m, s, t = d(loc), d(scale), d(thr)
    xs = [thr + math.exp(loc + scale * v) for v in (-8, -2, -0.3, 0, 1, 4, 9)]
    return rows_for("lognormal", [loc, scale, thr], xs, PS,
                    lambda x: mpmath.npdf(mpmath.log(x - t), m, s) / (x - t),
                    lambda x: mpmath.ncdf(mpmath.log(x - t), m, s),
                    lambda x: mpmath.ncdf(-mpmath.log(x - t), -m, s),
                    lambda p: t + mpmath.exp(m + s * mpmath.sqrt(2) * mpmath.erfinv(2 * p - 1)))


def halfnormal(scale, loc):
    s, m = d(scale), d(loc)
    xs = [loc + scale * v for v in (1e-3, 0.2, 1, 2.5, 5)]
    # (1 + p)/2 keeps p to absolute precision only: p >= 1e-6 for 1e-8 relative.
    return rows_for("halfnormal", [scale, loc], xs, [p for p in PS if 1e-6 <= p <= 0.99],
                    lambda x: 2 * mpmath.npdf(x, m, s),
                    lambda x: mpmath.erf((x - m) / (s * mpmath.sqrt(2))),
                    lambda x: mpmath.erfc((x - m) / (s * mpmath.sqrt(2))),
                    lambda p: m + s * mpmath.sqrt(2) * mpmath.erfinv(p))


# --- discrete --------------------------------------------------------------

def quantile_rows(family, params, ps, cdf, kmin, kmax):
    # Smallest k with F(k) >= p; p too close to a jump is skipped.
    p4 = [float(v) for v in params] + [0.0] * (4 - len(params))
    out = []
    for p in ps:
        P = d(p)
        lo, hi = kmin, kmax
        while lo < hi:
            mid = (lo + hi) // 2
            if cdf(mid) >= P:
                hi = mid
            else:
                lo = mid + 1
        near = [abs(cdf(lo) - P), abs(cdf(lo - 1) - P) if lo > kmin else mpf(1)]
        if min(near) < P * mpf(10) ** -6:
            continue
        out.append([family, "inv", float(p)] + p4 + [mpf(lo)])
    return out


def binomial(n, p):
    N, P = mpf(n), d(p)

    def pmf(k):
        return mpmath.binomial(N, k) * P ** k * (1 - P) ** (N - k)

    def low(k):
        if k < 0:
            return mpf(0)
        if k >= n:
            return mpf(1)
        # The integral from P to 1 is taken as one from 0 to 1 - P: mpmath forms
        # the former as a difference and loses the small tail.
        return mpmath.betainc(N - k, k + 1, 0, 1 - P, regularized=True)

    def up(k):
        return 1 - low(k - 1) if k <= 0 else mpmath.betainc(k, N - k + 1, 0, P, regularized=True)
    mean = n * p
    sd = math.sqrt(n * p * (1 - p))
    ks = sorted({int(v) for v in (0, 1, mean - 8 * sd, mean - 3 * sd, mean, mean + 2 * sd,
                                  mean + 6 * sd, n - 1, n) if 0 <= v <= n})
    out = []
    for k in ks:
        out.append(["binomial", "pdf", float(k), float(n), p, 0.0, 0.0, pmf(k)])
        out.append(["binomial", "lower", float(k), float(n), p, 0.0, 0.0, low(k)])
        out.append(["binomial", "upper", float(k), float(n), p, 0.0, 0.0, up(k)])
    out.append(["binomial", "lower", k + 0.5, float(n), p, 0.0, 0.0, low(k)])
    return out, low


def poisson(mean):
    m = d(mean)

    def low(k):
        return mpmath.gammainc(k + 1, m, mpmath.inf, regularized=True) if k >= 0 else mpf(0)

    def up(k):
        return mpmath.gammainc(k, 0, m, regularized=True) if k >= 1 else mpf(1)
    sd = math.sqrt(mean)
    ks = sorted({int(v) for v in (0, 1, mean - 6 * sd, mean - 2 * sd, mean, mean + 3 * sd,
                                  mean + 10 * sd + 5) if v >= 0})
    out = []
    for k in ks:
        out.append(["poisson", "pdf", float(k), mean, 0.0, 0.0, 0.0,
                    mpmath.exp(-m + k * mpmath.log(m) - mpmath.loggamma(k + 1))])
        out.append(["poisson", "lower", float(k), mean, 0.0, 0.0, 0.0, low(k)])
        out.append(["poisson", "upper", float(k), mean, 0.0, 0.0, 0.0, up(k)])
    out += quantile_rows("poisson", [mean], PS[1:-1], low, 0, int(mean + 40 * sd + 50))
    return out


def negbinomial(p, r, family="negbinomial"):
    P, R = d(p), d(r)

    def low(k):  # P(X <= k) = I_p(r, k - r + 1)
        return mpmath.betainc(R, k - R + 1, 0, P, regularized=True) if k >= r else mpf(0)

    def up(k):
        return 1 - low(k - 1) if k <= r else mpmath.betainc(k - R, R, 0, 1 - P, regularized=True)

    def pmf(k):
        if k < r:
            return mpf(0)
        return mpmath.binomial(k - 1, R - 1) * P ** R * (1 - P) ** (k - R)
    mean = r / p
    sd = math.sqrt(r * (1 - p)) / p
    ks = sorted({int(v) for v in (r, r + 1, mean - 2 * sd, mean, mean + 2 * sd, mean + 8 * sd)
                 if v >= r})
    params = [p] if family == "geometric" else [p, r]
    out = []
    for k in ks:
        out.append([family, "pdf", float(k)] + params + [0.0] * (4 - len(params)) + [pmf(k)])
        out.append([family, "lower", float(k)] + params + [0.0] * (4 - len(params)) + [low(k)])
        out.append([family, "upper", float(k)] + params + [0.0] * (4 - len(params)) + [up(k)])
    out += quantile_rows(family, params, [q for q in PS[1:-1]], low, int(r),
                         int(mean + 60 * sd + 100))
    return out


def hypergeometric(N, M, n):
    lo, hi = max(0, M + n - N), min(M, n)
    total = Fraction(math.comb(N, n))

    def pmf(k):
        return Fraction(math.comb(M, k) * math.comb(N - M, n - k)) / total

    masses = [pmf(k) for k in range(lo, hi + 1)]
    cum = []
    s = Fraction(0)
    for m in masses:
        s += m
        cum.append(s)

    def low(k):
        if k < lo:
            return Fraction(0)
        if k >= hi:
            return Fraction(1)
        return cum[k - lo]

    def up(k):
        return 1 - low(k - 1)
    ks = sorted({lo, lo + 1, (lo + hi) // 2, (M * n) // N, hi - 1, hi} & set(range(lo, hi + 1)))
    out = []
    for k in ks:
        for fn, v in (("pdf", pmf(k)), ("lower", low(k)), ("upper", up(k))):
            out.append(["hypergeometric", fn, float(k), float(N), float(M), float(n), 0.0,
                        mpf(v.numerator) / v.denominator])
    out += quantile_rows("hypergeometric", [N, M, n], PS[1:-1],
                         lambda k: mpf(low(k).numerator) / low(k).denominator, lo, hi)
    return out


def main():
    rows = []
    for scale, thr in ((1.0, 0.0), (2.5, -1.0), (1e-3, 10.0)):
        rows += exponential(scale, thr)
    for loc, scale in ((0.0, 1.0), (3.0, 0.5)):
        rows += lev(loc, scale, "lev")
        rows += lev(loc, scale, "sev")
    for shape, scale, thr in ((1.0, 1.0, 0.0), (0.5, 2.0, 1.0), (3.7, 0.8, -2.0)):
        rows += weibull(shape, scale, thr)
    for loc, scale in ((0.0, 1.0), (-2.0, 3.0)):
        rows += laplace(loc, scale)
    for lam, loc, scale in ((0.0, 0.0, 1.0), (1.0, 1.0, 2.0), (2.0, 0.0, 1.0), (0.14, 0.0, 1.0),
                            (0.5, -1.0, 2.0), (3.0, 0.0, 1.0)):
        rows += tukey(lam, loc, scale)
    for shape, scale, thr in ((0.5, 1.0, 0.0), (1.0, 2.0, 0.0), (4.5, 1.5, 3.0), (150.0, 1.0, 0.0),
                              (0.01, 1.0, 0.0)):
        rows += gamma_family(shape, scale, thr)
    for df, nc in ((1.0, 0.0), (5.0, 0.0), (80.0, 0.0), (4.0, 3.0), (10.0, 40.0)):
        rows += chisq(df, nc)
    for mean, sigma in ((0.0, 1.0), (10.0, 3.0)):
        rows += normal(mean, sigma)
    for loc, scale, thr in ((0.0, 1.0, 0.0), (1.0, 0.5, 2.0)):
        rows += lognormal(loc, scale, thr)
    for scale, loc in ((1.0, 0.0), (2.0, -1.0)):
        rows += halfnormal(scale, loc)
    for n, p in ((10, 0.5), (20, 0.1), (100, 0.73), (1000, 0.002), (5000, 0.4)):
        rows += binomial(n, p)[0]
    for mean in (0.5, 3.0, 40.0, 1000.0):
        rows += poisson(mean)
    for p, r in ((0.3, 3.0), (0.05, 2.0), (0.7, 10.0), (0.5, 1.0)):
        rows += negbinomial(p, r)
    for p in (0.2, 0.001):
        rows += negbinomial(p, 1.0, "geometric")
    for N, M, n in ((20, 7, 5), (50, 25, 30), (1000, 400, 150), (30, 29, 10)):
        rows += hypergeometric(N, M, n)
    write_rows(os.path.join(DATA, "kernels.csv"),
               "family,function,x,param1,param2,param3,param4,expected", rows)
    write_pvalues()


# --- two-sided P-values by enumeration ---------------------------------------

def binomial_two_sided(k, n, p):
    P = Fraction(p)
    pmf = [math.comb(n, j) * P ** j * (1 - P) ** (n - j) for j in range(n + 1)]

    def lr(j):
        q = mpf(j) / n
        pp = mpf(p)
        v = mpf(0)
        if j < n:
            v += (n - j) * mpmath.log((1 - q) / (1 - pp))
        if j > 0:
            v += j * mpmath.log(q / pp)
        return v
    L = lr(k)
    total = Fraction(0)
    for j in range(n + 1):
        r = lr(j)
        if j != k and abs(r - L) < mpf(10) ** -9 * max(1, abs(L)) and abs(r - L) > mpf(10) ** -40:
            return None  # a near-tie: the ordering depends on rounding
        if r >= L - mpf(10) ** -40:
            total += pmf[j]
    return mpf(total.numerator) / total.denominator


def fisher_two_sided(x, N, M, n):
    lo, hi = max(0, M + n - N), min(M, n)
    pm = {k: Fraction(math.comb(M, k) * math.comb(N - M, n - k), math.comb(N, n))
          for k in range(lo, hi + 1)}
    px = pm[x]
    total = Fraction(0)
    for k, v in pm.items():
        if v != px and abs(v - px) < px * Fraction(1, 10 ** 9):
            return None
        if v <= px:
            total += v
    return mpf(total.numerator) / total.denominator


def write_pvalues():
    rows = []
    for n, p in ((10, 0.5), (11, 0.5), (12, 0.3), (25, 0.1), (40, 0.75), (60, 0.55), (100, 0.02),
                 (150, 0.9), (200, 0.37)):
        for k in range(0, n + 1, max(1, n // 12)):
            v = binomial_two_sided(k, n, p)
            if v is not None:
                rows.append(["binomial", float(k), float(n), p, 0.0, 0, v])
        mode = int(n * p)
        for k in (mode, mode + 1, n - mode):
            v = binomial_two_sided(k, n, p)
            if v is not None and 0 <= k <= n:
                rows.append(["binomial", float(k), float(n), p, 0.0, 0, v])
    for N, M, n in ((20, 10, 10), (20, 7, 5), (30, 12, 14), (50, 25, 30), (40, 4, 20), (100, 37, 45),
                    (16, 8, 8), (200, 120, 90)):
        lo, hi = max(0, M + n - N), min(M, n)
        for x in range(lo, hi + 1, max(1, (hi - lo) // 14)):
            v = fisher_two_sided(x, N, M, n)
            if v is not None:
                rows.append(["hypergeometric", float(x), float(N), float(M), float(n), 0, v])
    write_rows(os.path.join(DATA, "kernels_pvalues.csv"),
               "family,x,n_or_N,p_or_M,n_or_0,alternative,expected", rows)


if __name__ == "__main__":
    main()
