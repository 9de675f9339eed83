#!/usr/bin/env python3
"""Reference values for the proportion and variance intervals that no peer
computes in the same form: the mid-P bounds (findroot on the exact mid-P
equation), mid-P and doubled exact P-values, the likelihood-ratio ordered
exact P-value, Agresti-Coull / Agresti-Caffo, corrected Wald, one-sided and
corrected Wilson limits, the corrected score test, Bonett's one-sample
limits and its trimmed kurtosis, all by their formulas in mpmath.

Writes tests/data/proportions.csv and tests/data/variances.csv; reads the samples of
tests/data/variance_samples.csv (written by gen_proportions_variances_r.R).
Run: python3 tools/reference/gen_proportions_variances.py
"""
import os

import mpmath
from mpmath import mpf

from refdata import write_rows, d

HERE = os.path.dirname(os.path.abspath(__file__))
DATA = os.path.join(HERE, "..", "..", "tests", "data")


def zq(p):
    """Standard normal quantile."""
    return mpmath.sqrt(2) * mpmath.erfinv(2 * mpf(p) - 1)


def ncdf_upper(z):
    return mpmath.erfc(z / mpmath.sqrt(2)) / 2


def pdf(x, n, p):
    if x < 0 or x > n:
        return mpf(0)
    return mpmath.binomial(n, x) * p**x * (1 - p) ** (n - x)


def _sum_from(x, n, p, step):
    """Sum of pmf terms from x outward (step +1 or -1), until negligible."""
    if p == 0 or p == 1:
        return mpmath.fsum(pdf(k, n, p) for k in (range(x, n + 1) if step > 0 else range(x, -1, -1)))
    term = pdf(x, n, p)
    total = mpf(0)
    k = x
    r = p / (1 - p)
    while 0 <= k <= n:
        total += term
        if term < total * mpf(10) ** -55:
            break
        term = term * ((n - k) / mpf(k + 1) * r if step > 0 else k / mpf(n - k + 1) / r)
        k += step
    return total


def upper_tail(x, n, p):
    """P(X >= x), summed where the terms fall away from x."""
    if x <= 0:
        return mpf(1)
    if x > n:
        return mpf(0)
    if x >= n * p:
        return _sum_from(x, n, p, 1)
    return 1 - _sum_from(x - 1, n, p, -1)


def lower_tail(x, n, p):
    """P(X <= x)."""
    if x >= n:
        return mpf(1)
    if x < 0:
        return mpf(0)
    if x <= n * p:
        return _sum_from(x, n, p, -1)
    return 1 - _sum_from(x + 1, n, p, 1)


def midp_bound(lower, x, n, alpha):
    if lower and x == 0:
        return mpf(0)
    if not lower and x == n:
        return mpf(1)
    if lower:
        f = lambda p: upper_tail(x, n, p) - pdf(x, n, p) / 2 - alpha
    else:
        f = lambda p: lower_tail(x, n, p) - pdf(x, n, p) / 2 - alpha
    a, b = mpf(0), mpf(1)
    return mpmath.findroot(f, (a, b), solver="illinois", tol=mpf(10) ** -50, verify=False)


def lr(n, k, p):
    def term(a, e):
        return a * mpmath.log(a / e) if a > 0 else mpf(0)
    return term(k, n * p) + term(n - k, n * (1 - p))


def lr_pvalue(x, n, p):
    """Outcomes whose likelihood-ratio statistic reaches the observed one;
    None near a tie, where rounding decides the side of an outcome."""
    obs = lr(n, x, p)
    if any(k != x and abs(lr(n, k, p) - obs) < mpf(10) ** -6 * obs for k in range(n + 1)):
        return None
    return mpmath.fsum(pdf(k, n, p) for k in range(n + 1) if lr(n, k, p) >= obs * (1 - mpf(10) ** -12))


def interval(conf, typ, est, se):
    if typ == 0:
        q = zq((1 + mpf(conf)) / 2)
        return est - q * se, est + q * se
    q = zq(conf)
    if typ == 1:
        return est - q * se, mpmath.inf
    return -mpmath.inf, est + q * se


def trimmed_mean(s, trim):
    n = len(s)
    h = n * trim
    g = int(mpmath.floor(h))
    f = h - g
    inner = mpmath.fsum(s[g + 1:n - 1 - g])
    return (inner + (1 - f) * (s[g] + s[n - 1 - g])) / (n - 2 * h)


def kurtosis(x):
    n = len(x)
    s = sorted(x)
    mean = mpmath.fsum(x) / n
    var = mpmath.fsum((v - mean) ** 2 for v in x) / (n - 1)
    trim = 1 / (2 * mpmath.sqrt(n - 4)) if n > 5 else mpf(0)
    m = trimmed_mean(s, trim)
    return n * mpmath.fsum((v - m) ** 4 for v in x) / ((n - 1) * var) ** 2, var


def main():
    rows = []
    for n in (10, 100, 1000, 10000):
        for x in sorted({0, 1, n // 3, n - 1, n}):
            for alpha in (0.025, 0.05):
                rows.append(["midp", x, n, alpha, 0, midp_bound(True, x, n, d(alpha)),
                             midp_bound(False, x, n, d(alpha))])
    for x, n in ((0, 10), (3, 10), (17, 60), (1, 1000), (500, 1000), (999, 1000)):
        for p0 in (0.05, 0.3, 0.5, 0.8):
            p = d(p0)
            lo, up, f = lower_tail(x, n, p), upper_tail(x, n, p), pdf(x, n, p)
            rows.append(["midptest", x, n, p0, -1, lo - f / 2, 0])
            rows.append(["midptest", x, n, p0, 1, up - f / 2, 0])
            rows.append(["midptest", x, n, p0, 0, min(1, 2 * min(lo, up)) - f, 0])
            rows.append(["cptest", x, n, p0, 0, min(1, 2 * min(lo, up)), 0])
            lrp = lr_pvalue(x, n, p) if n <= 1000 else None
            if lrp is not None:
                rows.append(["lynexact", x, n, p0, 0, lrp, 0])
    for x, n in ((0, 10), (3, 10), (17, 60), (500, 1000), (40, 41)):
        for conf in (0.9, 0.95):
            for typ in (-1, 0, 1):
                z = zq((1 + d(conf)) / 2)
                for add in (1, 0):
                    xs, ns = (x + 2, n + 4) if add else (x + z * z / 2, n + z * z)
                    p = xs / ns
                    rows.append(["agresti", x, n, conf, typ, add,
                                 *interval(d(conf), typ, p, mpmath.sqrt(p * (1 - p) / ns))])
                p = mpf(x) / n
                lo, up = interval(d(conf), typ, p, mpmath.sqrt(p * (1 - p) / n))
                rows.append(["waldcc", x, n, conf, typ, 1, lo - mpf(1) / (2 * n),
                             up + mpf(1) / (2 * n)])
                z2 = z * z
                dd = n + z2
                q = z if typ == 0 else zq(d(conf))
                s = mpmath.sqrt((1 - mpf(x) / n) * x + z2 / 4) / dd
                c = (x + z2 / 2) / dd
                rows.append(["wilson", x, n, conf, typ, 0, c - q * s if typ != -1 else -mpmath.inf,
                             c + q * s if typ != 1 else mpmath.inf])
                a, b = x - mpf(1) / 2, x + mpf(1) / 2
                argl = ((n - x + mpf(1) / 2) / n) * a + z2 / 4
                argu = ((n - x - mpf(1) / 2) / n) * b + z2 / 4
                lo = (a + z2 / 2) / dd - q * mpmath.sqrt(argl) / dd if argl >= 0 else None
                up = (b + z2 / 2) / dd + q * mpmath.sqrt(argu) / dd if argu >= 0 else None
                rows.append(["wilson", x, n, conf, typ, 1, lo if typ != -1 else -mpmath.inf,
                             up if typ != 1 else mpmath.inf])
        for p0 in (0.2, 0.5, 0.7):
            p = d(p0)
            for alt in (-1, 0, 1):
                c = {-1: mpf(1) / 2, 1: -mpf(1) / 2}.get(alt, -mpf(1) / 2 if abs(x - n * p) >= n / mpf(2) else 0)
                z = (x - n * p + c) / mpmath.sqrt((1 - p) * n * p)
                pv = {-1: 1 - ncdf_upper(z), 1: ncdf_upper(z)}.get(alt, 2 * min(ncdf_upper(z), 1 - ncdf_upper(z)))
                rows.append(["scorecc", x, n, p0, alt, 1, z, pv])
    for x1, n1, x2, n2 in ((15, 40, 9, 45), (3, 12, 8, 11), (0, 20, 5, 25)):
        for conf in (0.9, 0.95):
            for typ in (-1, 0, 1):
                z = zq((1 + d(conf)) / 2)
                for add in (1, 0):
                    e, t = (1, 2) if add else (z * z / 4, z * z / 2)
                    p1, p2 = (x1 + e) / (n1 + t), (x2 + e) / (n2 + t)
                    se = mpmath.sqrt(p1 * (1 - p1) / (n1 + t) + p2 * (1 - p2) / (n2 + t))
                    rows.append(["caffo", x1, n1, x2, n2, conf, typ, add, *interval(d(conf), typ, p1 - p2, se)])
                p1, p2 = mpf(x1) / n1, mpf(x2) / n2
                se = mpmath.sqrt(p1 * (1 - p1) / n1 + p2 * (1 - p2) / n2)
                lo, up = interval(d(conf), typ, p1 - p2, se)
                dc = (mpf(1) / n1 + mpf(1) / n2) / 2
                rows.append(["wald2cc", x1, n1, x2, n2, conf, typ, 1, lo - dc, up + dc])
    write_rows(os.path.join(DATA, "proportions.csv"), "kind,fields... (see generator)", rows)
    rows = []
    samples = {}
    with open(os.path.join(DATA, "variance_samples.csv")) as f:
        for line in f:
            if line.startswith("#"):
                continue
            parts = line.strip().split(",")
            samples[parts[0]] = [d(v) for v in parts[1:]]
    for name in ("a", "c", "e", "g", "h"):
        x = samples[name]
        n = len(x)
        k, var = kurtosis(x)
        for conf in (0.9, 0.95):
            for typ in (-1, 0, 1):
                z = zq((1 + d(conf)) / 2 if typ == 0 else d(conf))
                c = k + mpf(3) / n - 1
                f = n / (n - z)
                w = mpmath.exp(z * f * mpmath.sqrt(c / (n - 1)))
                rows.append(["bonett1", name, "-", conf, typ, k, f * var / w if typ != -1 else 0,
                             f * var * w if typ != 1 else mpmath.inf])
    write_rows(os.path.join(DATA, "variances.csv"),
               "kind,sample,-,confidence,type,kurtosis,lower,upper", rows)


main()
