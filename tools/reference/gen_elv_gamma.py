#!/usr/bin/env python3
"""Reference values for the high-accuracy gamma, Poisson and chi-square
routines, at 60 significant digits.

Writes to tests/data:
  elv_gamma.csv      a,x,lower,upper,density       P(a,x), Q(a,x), x^(a-1)e^-x/Gamma(a)
  elv_poisson.csv    k,m,lower,upper,mass          P(X<=k), P(X>k), P(X=k)
  elv_ncchi2.csv     x,df,L,lower,upper            noncentral chi-square tails
  elv_arithmetic.csv function,x1,x2,x3,x4,expected   the shared arithmetic helpers
  elv_quantiles.csv  kind,p,param,q,sensitivity,fraction
                     gamma quantiles (kind gamma_lower, gamma_upper; sensitivity =
                     q f(q)/p, so that a relative error e in q moves the probability
                     by about e*sensitivity relatively; fraction 0) and Poisson
                     quantiles (kind poisson_lower, poisson_upper; q is the index k,
                     sensitivity P(X=k)/p and fraction the fraction f).

Both tails are computed in their own right: the smaller one never as 1 minus
the larger. Tails below 1e-320 are written as 0.

Incomplete gamma: mpmath.gammainc for moderate shapes; for shapes above 1e4
(where its series gives up) the lower tail from mpmath.hyp1f1,
  P(a,x) = x^a e^-x / Gamma(a+1) 1F1(1; a+1; x),
and the upper tail from Legendre's continued fraction (modified Lentz) when
it is the smaller one. The noncentral chi-square tails are the Poisson
mixtures summed term by term in the stable direction of each tail's
recurrence (lower tail downwards from far above the Poisson window, upper
tail upwards from index 0 until the terms are negligible).

Run: /usr/bin/python3 tools/reference/gen_elv_gamma.py   (about ten minutes)
"""
import math
import os
import sys

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import d, write_rows  # noqa: E402

import scipy.special as sc  # starting values of the quantile searches only

mpmath.mp.dps = 60
DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")
MAX_DF = 189812530.0
MAX_SHAPE = 94906265.0


def clamp(v):
    return mpf(0) if abs(v) < mpf("1e-320") else v


def log_density(a, x):
    """ln(x^(a-1) e^-x / Gamma(a))."""
    return (a - 1) * mpmath.log(x) - x - mpmath.loggamma(a)


def upper_cf(a, x):
    """Gamma(a,x)/Gamma(a) by Legendre's continued fraction (x > a, x >= 1)."""
    tiny = mpf(10) ** -400
    eps = mpf(10) ** -58
    b = x + 1 - a
    c = 1 / tiny
    dd = 1 / b
    h = dd
    i = 0
    while True:
        i += 1
        an = -i * (i - a)
        b += 2
        dd = an * dd + b
        if dd == 0:
            dd = tiny
        c = b + an / c
        if c == 0:
            c = tiny
        dd = 1 / dd
        delta = dd * c
        h *= delta
        if abs(delta - 1) < eps:
            break
        if i > 2000000:
            raise RuntimeError("continued fraction: no convergence at a=%s x=%s" % (a, x))
    return mpmath.exp(a * mpmath.log(x) - x - mpmath.loggamma(a)) * h


def lower_series(a, x):
    return mpmath.exp(a * mpmath.log(x) - x - mpmath.loggamma(a + 1)) * mpmath.hyp1f1(
        1, a + 1, x, maxterms=10 ** 7)


def tails(a, x):
    """(P(a,x), Q(a,x)), each to full relative accuracy."""
    a, x = mpf(a), mpf(x)
    if x == 0:
        return mpf(0), mpf(1)
    if a <= 1e4:
        return (mpmath.gammainc(a, 0, x, regularized=True),
                mpmath.gammainc(a, x, mpmath.inf, regularized=True))
    if x < a:
        p = lower_series(a, x)
        if p < 0.5:
            return p, 1 - p
    q = upper_cf(a, x)
    return 1 - q, q


# ---------------------------------------------------------------- gamma_df
GAMMA_SHAPES = [1e-3, 0.01, 0.1, 0.3, 0.5, 0.59, 0.8, 1.0, 1.2, 1.5, 2.0, 3.5, 7.0, 10.0, 25.5,
                100.0, 1e3, 1e4, 1e5, 1e6, 1e7, 9e7, MAX_SHAPE]
GAMMA_Z = [-40, -30, -20, -10, -6, -3, -1, -0.3, 0, 0.3, 1, 3, 6, 10, 20, 30, 40, 60, 100]
GAMMA_ABS = [1e-300, 1e-100, 1e-20, 1e-8, 1e-3, 0.05, 0.5, 1.0, 2.0, 5.0, 20.0, 100.0, 700.0,
             1000.0]
GAMMA_REL = [1e-3, 0.1, 0.5, 0.9, 1.1, 2.0, 5.0]


# Points where a tail is just above the underflow limit while the density is
# below it (the fallback branches of both tails).
GAMMA_EXTRA = {9e7: [90343423.353894278, 90343897.695543304, 89657050.987754732,
                     89656576.646105722]}
POISSON_EXTRA = {9e7: [90342982, 89657417]}


def gamma_points(a):
    s = math.sqrt(max(a, 1.0))
    xs = {a + z * s for z in GAMMA_Z} | set(GAMMA_ABS) | {a * f for f in GAMMA_REL}
    xs |= set(GAMMA_EXTRA.get(a, []))
    return sorted(x for x in xs if 0 < x <= MAX_DF)


def gen_gamma():
    rows = []
    for a in GAMMA_SHAPES:
        for x in gamma_points(a):
            A, X = d(a), d(x)
            p, q = tails(A, X)
            rows.append([float(a), float(x), clamp(p), clamp(q),
                         clamp(mpmath.exp(log_density(A, X)))])
    write_rows(os.path.join(DATA, "elv_gamma.csv"), "a,x,lower,upper,density", rows)
    return len(rows)


# ---------------------------------------------------------------- Poisson
POISSON_MEANS = [1e-3, 0.1, 1.0, 2.5, 10.0, 36.0, 37.5, 100.0, 1e3, 1e4, 1e5, 1e6, 1e7, 9e7,
                 MAX_SHAPE]
POISSON_Z = [-40, -30, -20, -10, -5, -2, -1, 0, 1, 2, 5, 10, 20, 30, 40, 60]


def poisson_points(m):
    s = math.sqrt(m)
    ks = {int(math.floor(m + z * s)) for z in POISSON_Z} | {0, 1, 2, 5, 10, 100, 1000}
    ks |= {int(m + 80 * s + 400), int(3 * m + 600)} | set(POISSON_EXTRA.get(m, []))
    return sorted(k for k in ks if 0 <= k < 94906266)


def poisson_tails(k, m):
    """(P(X<=k), P(X>k), P(X=k)) = (Q(k+1,m), P(k+1,m), mass)."""
    M = mpf(m)
    p, q = tails(k + 1, M)
    mass = mpmath.exp(k * mpmath.log(M) - M - mpmath.loggamma(k + 1))
    return q, p, mass


def gen_poisson():
    rows = []
    for m in POISSON_MEANS:
        for k in poisson_points(m):
            lower, upper, mass = poisson_tails(k, d(m))
            rows.append([str(k), float(m), clamp(lower), clamp(upper), clamp(mass)])
    write_rows(os.path.join(DATA, "elv_poisson.csv"), "k,m,lower,upper,mass", rows)
    return len(rows)


# ---------------------------------------------------------------- noncentral chi-square
NC_DF = [0.0, 0.5, 1.0, 2.0, 5.0, 10.0, 50.0, 100.0, 1000.0, 1e4, 1e6]
NC_L = [0.01, 0.5, 2.0, 10.0, 50.0, 200.0, 1000.0, 1e4]
NC_Z = [-6, -3, -1, 0, 1, 3, 6, 10, 20, 40]


def nc_lower(a, lam, y):
    """sum_j Poisson(j; lam) P(a+j, y), summed downwards (stable)."""
    J = int(lam + 60 * math.sqrt(lam) + 200)
    b = a + J
    P, _ = tails(b, y)
    g = mpmath.exp(b * mpmath.log(y) - y - mpmath.loggamma(b + 1))  # y^b e^-y / Gamma(b+1)
    w = mpmath.exp(J * mpmath.log(lam) - lam - mpmath.loggamma(J + 1))
    total = w * P
    for j in range(J, 0, -1):
        # from index j to j-1: P(b-1) = P(b) + g(b-1), g(b-1) = g(b) b / y
        g = g * b / y
        b = b - 1
        P = P + g
        w = w * j / lam
        total += w * P
    return total


def nc_upper(a, lam, y):
    """sum_j Poisson(j; lam) Q(a+j, y), summed upwards (stable)."""
    j = 1 if a == 0 else 0
    b = a + j
    _, Q = tails(b, y)
    g = mpmath.exp(b * mpmath.log(y) - y - mpmath.loggamma(b + 1))
    w = mpmath.exp(j * mpmath.log(lam) - lam - mpmath.loggamma(j + 1))
    total = w * Q
    last = total
    while True:
        # from index j to j+1: Q(b+1) = Q(b) + g(b), g(b+1) = g(b) y / (b+1)
        Q = Q + g
        b = b + 1
        g = g * y / b
        j += 1
        w = w * lam / j
        term = w * Q
        total += term
        if j > lam + 10 and term < last and term < total * mpf(10) ** -62:
            break
        last = term
        if j > 5000000:
            raise RuntimeError("upper mixture sum too long")
    return total


def nc_points(df, L):
    mean = df + L
    sd = math.sqrt(2 * (df + 2 * L))
    xs = {mean + z * sd for z in NC_Z} | {1e-3, mean}
    return sorted(x for x in xs if x > 0)


def gen_ncchi2():
    rows = []
    for df in NC_DF:
        for L in NC_L:
            for x in nc_points(df, L):
                a, lam, y = d(df) / 2, d(L) / 2, d(x) / 2
                rows.append([float(x), float(df), float(L), clamp(nc_lower(a, lam, y)),
                             clamp(nc_upper(a, lam, y))])
    write_rows(os.path.join(DATA, "elv_ncchi2.csv"), "x,df,L,lower,upper", rows)
    return len(rows)


# ---------------------------------------------------------------- quantiles
Q_SHAPES = [1e-3, 0.01, 0.03, 0.1, 0.5, 1.0, 1.5, 3.0, 10.0, 10.5, 100.0, 1e3, 1e4, 1e5, 1e7]
Q_PROBS = [1e-12, 1e-8, 1e-4, 0.01, 0.05, 0.2, 0.3, 0.45, 0.5]


def gamma_quantile(p, a, upper):
    """x with Q(a,x) = p (upper) or P(a,x) = p, by Newton's method in ln x."""
    P, A = d(p), d(a)
    guess = sc.gammainccinv(a, p) if upper else sc.gammaincinv(a, p)
    if not (guess > 0) or not math.isfinite(guess):
        guess = 1e-300
    t = mpmath.log(mpf(guess))
    for _ in range(200):
        x = mpmath.exp(t)
        lo, up = tails(A, x)
        f = up if upper else lo
        # d ln F / d ln x = +-x density / F
        dens = mpmath.exp(log_density(A, x))
        slope = (-1 if upper else 1) * x * dens / f
        step = (mpmath.log(f) - mpmath.log(P)) / slope
        t -= step
        if abs(step) < mpf(10) ** -40:
            break
    x = mpmath.exp(t)
    sens = x * mpmath.exp(log_density(A, x)) / P
    return x, sens


def poisson_quantile(p, m, upper):
    """(k, f): upper form largest k with P(X>k) <= p, f = (p - P(X>k))/P(X=k);
    lower form smallest k with P(X<=k) > p, f = (p - P(X<k))/P(X=k)."""
    P, M = d(p), d(m)
    z = float(mpmath.sqrt(2) * mpmath.erfinv(1 - 2 * P))  # upper deviate
    if upper:
        k = max(0, int(m + z * math.sqrt(m)) + 3)
        while True:
            lower, up, mass = poisson_tails(k, M)
            if up <= P:
                # step down while P(X > k-1) <= p
                if k == 0:
                    break
                lo2, up2, mass2 = poisson_tails(k - 1, M)
                if up2 <= P:
                    k -= 1
                    continue
                break
            k += 1
        lower, up, mass = poisson_tails(k, M)
        return k, (P - up) / mass, mass / P
    k = max(0, int(m - z * math.sqrt(m)) - 3)
    while True:
        lower, up, mass = poisson_tails(k, M)
        if lower > P:
            if k == 0:
                break
            lo2, up2, mass2 = poisson_tails(k - 1, M)
            if lo2 > P:
                k -= 1
                continue
            break
        k += 1
    lower, up, mass = poisson_tails(k, M)
    return k, (P - (lower - mass)) / mass, mass / P


POISSON_Q_MEANS = [1e-13, 1e-7, 1e-4, 0.5, 5.0, 36.0, 37.0, 100.0, 1e3, 1e5, 1e7, 9e7]
POISSON_Q_PROBS = [1e-12, 5e-10, 1e-6, 0.05, 0.3, 0.5]


def gen_quantiles():
    rows = []
    for a in Q_SHAPES:
        for p in Q_PROBS:
            for upper in (False, True):
                q, sens = gamma_quantile(p, a, upper)
                rows.append(["gamma_upper" if upper else "gamma_lower", float(p), float(a),
                             clamp(q), sens, "0"])
    for m in POISSON_Q_MEANS:
        for p in POISSON_Q_PROBS:
            for upper in (False, True):
                k, f, sens = poisson_quantile(p, m, upper)
                rows.append(["poisson_upper" if upper else "poisson_lower", float(p), float(m),
                             str(k), sens, f])
    write_rows(os.path.join(DATA, "elv_quantiles.csv"), "kind,p,param,q,sensitivity,fraction", rows)
    return len(rows)


# ---------------------------------------------------------------- arithmetic
def ln_scaled_gamma(x):
    """ln(Gamma(x+1) (e/x)^x)."""
    return mpmath.loggamma(x + 1) + x - x * mpmath.log(x) if x != 0 else mpf(0)


def lnp_binomial(k, n, p):
    return (mpmath.loggamma(n + 1) - mpmath.loggamma(k + 1) - mpmath.loggamma(n - k + 1)
            + (k * mpmath.log(p) if k else 0) + ((n - k) * mpmath.log(1 - p) if n - k else 0))


def lnp_hyper(k, N, M, n):
    def lnc(a, b):
        return mpmath.loggamma(a + 1) - mpmath.loggamma(b + 1) - mpmath.loggamma(a - b + 1)
    return lnc(M, k) + lnc(N - M, n - k) - lnc(N, n)


def gen_arithmetic():
    rows = []

    def add(name, args, value):
        rows.append([name] + [float(a) for a in args] + [0.0] * (4 - len(args)) + [value])

    for x in [-0.999, -0.5, -0.02, -0.01, -0.005, -1e-8, 1e-300, 1e-8, 0.003, 0.0099, 0.01,
              0.02, 1.0, 1e10]:
        add("logs", [x], mpmath.log1p(d(x)))
    for x in [-662.0, -50.0, -0.5, -0.02, -0.0099, -1e-10, 1e-300, 1e-7, 0.005, 0.01, 0.02, 1.0,
              709.0]:
        add("exps", [x], mpmath.expm1(d(x)))
    for x in [1e-300, 1e-10, 0.3, 1.0, 1.5, 2.0, 2.5, 9.99, 10.0, 33.3, 171.5, 1e5, 1e300]:
        add("ln_gamma", [x], mpmath.loggamma(d(x)))
    for x in [1e-300, 1e-8, 1e-5, 1.5e-5, 0.3, 1.0, 8.99, 9.0, 9.01, 100.0, 1e8]:
        add("ln_scaled_gamma", [x], ln_scaled_gamma(d(x)))
    for x in [1e-300, 2e-16, 3e-16, 0.3, 1.0, 2.5, 9.5, 10.0, 33.3, 100.5, 171.6]:
        add("Gamma", [x], mpmath.gamma(d(x)))
    for x in [0.0, 1e-10, 5e-5, 1e-4, 1.0001e-4, 0.01, 0.5, 1.0]:
        X = d(x)
        add("gammod", [x], mpmath.euler if x == 0 else (1 - mpmath.gamma(1 + X)) / X)
    for x in [-2.5, 1e-6, 0.5, 1.0, 1.4616321449683622, 3.7, 9.99, 10.0, 50.0, 1e6]:
        X = d(x)
        add("psi", [x], mpmath.digamma(X))
        add("dpsi", [x], mpmath.psi(1, X))
        add("d2psi", [x], mpmath.psi(2, X))
    for x in [0.0, 0.5, -1.0, 3.0, -10.0, 37.0]:
        add("phi", [x], mpmath.npdf(d(x)))
    for a, x in [(0.5, 2.0), (2.0, 0.5), (0.3, 0.7), (3.0, 3.0), (50.0, 60.0), (50.0, 40.0),
                 (9e7, 9e7 + 3e4), (9e7, 9e7 - 3e4), (1e-3, 1e-200)]:
        A, X = d(a), d(x)
        add("lnpgamma", [a, x], (A - 1) * mpmath.log(X) - X - mpmath.loggamma(A))
    for a, b, x in [(0.5, 0.5, 0.3), (2.0, 3.0, 0.4), (2.0, 3.0, 0.01), (0.8, 5.0, 0.9),
                    (5.0, 0.8, 0.1), (1e6, 2e6, 0.3334), (1e6, 2e6, 0.3332), (30.0, 1.0, 0.99)]:
        A, B, X = d(a), d(b), d(x)
        add("lnpbeta", [a, b, x], (A - 1) * mpmath.log(X) + (B - 1) * mpmath.log(1 - X)
            - mpmath.log(mpmath.beta(A, B)))
    for k, m in [(0, 3.0), (1, 0.5), (5, 0.5), (3, 3.0), (10, 3.0), (100, 120.0),
                 (94906000, 94906265.0), (1000, 1e5)]:
        M = d(m)
        add("lnppoisson", [k, m], k * mpmath.log(M) - M - mpmath.loggamma(k + 1))
    for k, n, p in [(0, 10, 0.3), (10, 10, 0.3), (3, 10, 0.3), (7, 10, 0.3), (500, 1000, 0.5),
                    (1, 1e6, 1e-3), (5000, 1e6, 1e-3)]:
        add("lnpbinomial", [k, n, p], lnp_binomial(k, d(n), d(p)))
    for k, N, M, n in [(0, 20, 5, 4), (4, 20, 5, 4), (2, 20, 5, 4), (500, 2000, 1000, 1000),
                       (3, 1e6, 100, 1000)]:
        add("lnphyper", [k, N, M, n], lnp_hyper(k, d(N), d(M), d(n)))
    write_rows(os.path.join(DATA, "elv_arithmetic.csv"), "function,x1,x2,x3,x4,expected", rows)
    return len(rows)


def main():
    which = sys.argv[1:] or ["gamma", "poisson", "ncchi2", "quantiles", "arithmetic"]
    for name in which:
        count = {"gamma": gen_gamma, "poisson": gen_poisson, "ncchi2": gen_ncchi2,
                 "quantiles": gen_quantiles, "arithmetic": gen_arithmetic}[name]()
        print(name, count, "rows", flush=True)


if __name__ == "__main__":
    main()
