#!/usr/bin/env python3
"""Reference values for the special functions: the gamma helpers, error
function, digamma and polygamma, the incomplete gamma ratio, the incomplete
beta ratio and the derivatives of the incomplete gamma integral.

Writes, under tests/data/:
  transcendental_unary.csv      function,x,y,expected      (y = 0 for one-argument functions)
  polygamma.csv          x,order,expected           (-1)^(k+1) psi^(k-1)(x)/(k-1)!, k = order+1
  incomplete_gamma.csv   region,a,x,P,Q,cond  (cond: relative condition number of P in x)
  incomplete_beta.csv    branch,a,b,x,y,I,Ic,cond,condc (y = 1 - x exactly, or 1 for tiny x;
                         cond: relative condition number of each tail in x)
  digami.csv             x,p,d1,...,d6
Run with /usr/bin/python3 (mpmath 1.2.1).
"""
import math
import os
import sys

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import d, write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")
mpmath.mp.dps = 50
EPS = 2.0 ** -52


def logspace(lo, hi, n):
    return [10 ** (math.log10(lo) + (math.log10(hi) - math.log10(lo)) * i / (n - 1)) for i in range(n)]


def linspace(lo, hi, n):
    return [lo + (hi - lo) * i / (n - 1) for i in range(n)]


# ---------------------------------------------------------------- unary helpers
def unary_rows():
    rows = []

    def add(name, xs, f, ys=None):
        for i, x in enumerate(xs):
            y = 0.0 if ys is None else ys[i]
            rows.append([name, float(x), float(y), f(d(x), d(y))])

    add("gamln", logspace(1e-8, 1e6, 60) + linspace(0.5, 12, 47), lambda x, y: mpmath.loggamma(x))
    add("gamln1", linspace(-0.2, 1.25, 59) + [1e-10, -1e-10], lambda x, y: mpmath.loggamma(1 + x))
    add("gam1", linspace(-0.5, 1.5, 81) + [1e-10, -1e-10, 1 + 1e-10, 1 - 1e-10],
        lambda x, y: 1 / mpmath.gamma(x + 1) - 1)
    add("rlog", linspace(0.05, 5, 100) + linspace(0.6, 1.6, 41) + [1 + 1e-9, 1 - 1e-9],
        lambda x, y: x - 1 - mpmath.log(x))
    add("rlog1", linspace(-0.9, 3, 79) + linspace(-0.4, 0.6, 41) + [1e-9, -1e-9],
        lambda x, y: x - mpmath.log1p(x))
    add("rexp", linspace(-1, 1, 41) + linspace(-0.15, 0.15, 31) + [1e-12, -1e-12, 30.0, -30.0],
        lambda x, y: mpmath.expm1(x))
    add("alnrel", linspace(-0.9, 2, 59) + linspace(-0.375, 0.375, 31) + [1e-12, -1e-12],
        lambda x, y: mpmath.log1p(x))
    add("erf", linspace(-6, 6, 121) + [1e-10, -1e-10, 0.5, 4.0, 5.79, 5.81],
        lambda x, y: mpmath.erf(x))
    # erfc down to its last normal values (x^2 <= -exparg(1), about 26.6).
    add("erfc", linspace(-6, 26.5, 131) + [0.5, -0.5, 4.0, -4.0, -5.59, -5.61, 26.6],
        lambda x, y: mpmath.erfc(x))
    add("erfcx", linspace(-5, 30, 141) + [1e2, 1e4, 1e8],
        lambda x, y: mpmath.exp(x * x) * mpmath.erfc(x))
    psix = [x for x in linspace(-3.9, 0.45, 88) if abs(x - round(x)) > 1e-3]
    # For psi708 the y column is the scale of the reflection formula,
    # |psi(1 - x)| + |pi cot(pi x)| for x < 0.5 and |psi(x)| otherwise: its
    # error is relative to that scale.
    psiargs = psix + linspace(0.5, 3, 51) + logspace(3.01, 2.1e9, 40) + [1e-10, -1e-10, 1.4616321449683622]
    for x in psiargs:
        X = d(x)
        if x < 0.5:
            scale = abs(mpmath.digamma(1 - X)) + abs(mpmath.pi * mpmath.cot(mpmath.pi * X))
        else:
            scale = abs(mpmath.digamma(X))
        rows.append(["psi708", float(x), float(scale), mpmath.digamma(X)])
    add("lngamma", logspace(1e-12, 1e6, 61) + linspace(0.5, 3.0, 26),
        lambda x, y: mpmath.loggamma(x))
    add("xgamma", linspace(0.1, 20, 60), lambda x, y: mpmath.gamma(x))
    # two-argument helpers
    pairs = [(a, b) for a in logspace(1e-3, 1e4, 15) for b in logspace(1e-3, 1e5, 15)]
    add("betaln", [p[0] for p in pairs], lambda x, y: mpmath.log(mpmath.beta(x, y)), [p[1] for p in pairs])
    pairs = [(a, b) for a in logspace(1e-6, 1e5, 12) for b in logspace(8, 1e8, 12)]
    add("algdiv", [p[0] for p in pairs], lambda x, y: mpmath.loggamma(y) - mpmath.loggamma(x + y),
        [p[1] for p in pairs])

    def dl(x):
        return mpmath.loggamma(x) - (x - mpf(1) / 2) * mpmath.log(x) + x - mpmath.log(2 * mpmath.pi) / 2

    pairs = [(a, b) for a in logspace(8, 1e6, 10) for b in logspace(8, 1e6, 10)]
    add("bcorr", [p[0] for p in pairs], lambda x, y: dl(x) + dl(y) - dl(x + y), [p[1] for p in pairs])
    pairs = [(a, b) for a in linspace(1, 2, 9) for b in linspace(1, 2, 9)]
    add("gsumln", [p[0] for p in pairs], lambda x, y: mpmath.loggamma(x + y), [p[1] for p in pairs])
    return rows


# ---------------------------------------------------------------- polygamma
def polygamma_rows():
    rows = []
    xs = logspace(1e-6, 1e6, 40) + linspace(0.1, 20, 25) + [1e-12, 0.5, 1.0, 2.5]
    for x in xs:
        X = d(x)
        for k in range(1, 7):  # orders 0..5
            n = k - 1
            val = (-1) ** k * mpmath.polygamma(n, X) / mpmath.factorial(n)
            rows.append([float(x), n, val])
    # A few high orders, up to the limit of 100, on both sides of xmin.
    for x in [0.05, 0.7, 3.0, 25.0, 80.0, 400.0]:
        for n in [10, 40, 100]:
            val = (-1) ** (n + 1) * mpmath.polygamma(n, d(x)) / mpmath.factorial(n)
            rows.append([float(x), n, val])
    return rows


# ---------------------------------------------------------------- incomplete gamma
def gamma_region(a, x):
    if a < 1:
        if a == 0.5:
            return "a_half"
        return "a_small_series" if x < 1.1 else "a_small_fraction"
    if a < 20:
        if a <= x < 31 and (2 * a) == int(2 * a):
            return "finite_sum"
        if x <= max(a, math.log(10)):
            return "taylor"
        return "fraction" if x < 31 else "asymptotic"
    s = 1 - x / a
    if abs(s) <= 0.00025 / math.sqrt(a):
        return "temme_centre"
    if abs(s) <= 0.4:
        return "temme"
    return "large_a_series"


def lower_gamma_series(a, x):
    """P(a, x) = x^a e^-x / Gamma(a+1) sum x^n / ((a+1)...(a+n)), for x < a."""
    term = mpf(1)
    total = mpf(1)
    n = 0
    while term > total * mpf(10) ** -55:
        n += 1
        term *= x / (a + n)
        total += term
    return mpmath.exp(a * mpmath.log(x) - x - mpmath.loggamma(a + 1)) * total


def gamma_rows():
    pts = []
    for a in [0.01, 0.1, 0.3, 0.5, 0.7, 0.99]:
        for x in [1e-5, 0.01, 0.2, 0.5, 1.0, 1.09, 1.2, 2.0, 5.0, 20.0, 60.0]:
            pts.append((a, x))
    for a in [1.0, 1.5, 2.0, 3.7, 5.0, 7.5, 10.0, 12.3, 15.5, 19.0, 19.9]:
        for x in [0.01, 0.5, 2.0, 2.3, 4.0, 9.0, 14.0, 20.0, 30.0, 31.0, 45.0, 80.0]:
            pts.append((a, x))
    for a in [20.0, 25.0, 50.0, 100.0, 1000.0, 1e4, 1e6]:
        for s in [-3.0, -0.8, -0.41, -0.4, -0.2, -0.05, -0.01, -1e-3, -1e-4, -1e-5, 0.0,
                  1e-5, 1e-4, 1e-3, 0.01, 0.05, 0.2, 0.4, 0.41, 0.8, 0.99]:
            x = a * (1 - s)
            pts.append((a, x))
    rows = []
    for a, x in pts:
        A, X = d(a), d(x)
        # The smaller tail directly, the other as its complement.
        if X < A:
            P = lower_gamma_series(A, X)
            Q = 1 - P
        else:
            Q = mpmath.gammainc(A, X, mpmath.inf, regularized=True)
            P = 1 - Q
        # Relative condition number of P in x: x times the density over P.
        dens = mpmath.exp(A * mpmath.log(X) - X - mpmath.loggamma(A))
        rows.append([gamma_region(float(a), float(x)), float(a), float(x), P, Q,
                     mpmath.mpf(float(dens / P)) if P > 0 else mpf(0)])
    return rows


# ---------------------------------------------------------------- incomplete beta
def beta_branch(a, b, x, y):
    """The method that the driver picks, for labelling the data."""
    eps = max(EPS, 1e-15)
    if max(a, b) < 1e-3 * eps:
        return "tiny"
    a0, b0, x0, y0 = a, b, x, y
    if min(a, b) <= 1:
        if x > 0.5:
            a0, b0, x0, y0 = b, a, y, x
        if b0 < min(eps, eps * a0):
            return "fpser"
        if a0 < min(eps, eps * b0) and b0 * x0 <= 1:
            return "apser"
        if max(a0, b0) <= 1:
            if a0 >= min(0.2, b0) or x0 ** a0 <= 0.9:
                return "bpser"
            return "bpser_complement" if x0 >= 0.3 else "bup_bgrat"
        if b0 <= 1:
            return "bpser"
        if x0 >= 0.3:
            return "bpser_complement"
        if x0 < 0.1 and (x0 * b0) ** a0 <= 0.7:
            return "bpser"
        return "bgrat" if b0 > 15 else "bup_bgrat"
    lam = a - (a + b) * x if a <= b else (a + b) * y - b
    if lam < 0:
        a0, b0, x0, y0 = b, a, y, x
        lam = -lam
    if b0 < 40:
        if b0 * x0 <= 0.7:
            return "bpser"
        if x0 <= 0.7:
            return "bup_bpser"
        return "bup_bgrat" if a0 <= 15 else "bup_bgrat_large"
    small = min(a0, b0)
    if small <= 100 or lam > 0.03 * small:
        return "bfrac"
    return "basym"


def beta_fraction(a, b, x):
    """Continued fraction of I_x(a, b) (modified Lentz), for x < (a+1)/(a+b+2)."""
    tiny = mpf(10) ** -300
    tol = mpf(10) ** (2 - mpmath.mp.dps)
    qab, qap, qam = a + b, a + 1, a - 1
    c = mpf(1)
    dd = 1 - qab * x / qap
    dd = 1 / (dd if abs(dd) > tiny else tiny)
    h = dd
    m = 0
    while True:
        m += 1
        m2 = 2 * m
        aa = m * (b - m) * x / ((qam + m2) * (a + m2))
        dd = 1 + aa * dd
        dd = 1 / (dd if abs(dd) > tiny else tiny)
        c = 1 + aa / c
        c = c if abs(c) > tiny else tiny
        h *= dd * c
        aa = -(a + m) * (qab + m) * x / ((a + m2) * (qap + m2))
        dd = 1 + aa * dd
        dd = 1 / (dd if abs(dd) > tiny else tiny)
        c = 1 + aa / c
        c = c if abs(c) > tiny else tiny
        delta = dd * c
        h *= delta
        if abs(delta - 1) < tol:
            break
    lbeta = mpmath.loggamma(a) + mpmath.loggamma(b) - mpmath.loggamma(a + b)
    return mpmath.exp(a * mpmath.log(x) + b * mpmath.log1p(-x) - lbeta) / a * h


def beta_ratio(a, b, x):
    """I_x(a, b) and its complement, the smaller one computed directly."""
    if x < (a + 1) / (a + b + 2):
        small = beta_fraction(a, b, x)
        return small, 1 - small
    small = beta_fraction(b, a, 1 - x)
    return 1 - small, small


def snap(x):
    """x on the 2^-53 grid, so that 1 - x is exact."""
    if x < 1e-12:
        return x, 1.0
    k = round(x * 2.0 ** 53)
    xs = k / 2.0 ** 53
    return xs, 1.0 - xs


def beta_rows():
    pts = []
    # fpser: b very small
    for a in [0.5, 1.0, 5.0, 100.0]:
        for b in [1e-17, 1e-20, 1e-100]:
            for x in [1e-5, 0.01, 0.2, 0.5]:
                pts.append((a, b, x))
    pts.append((1e-17, 0.5, 0.7))  # exchanged to fpser
    # apser: a very small
    for a in [1e-17, 1e-20, 1e-100]:
        for b in [0.5, 2.0, 50.0, 1e3]:
            for x in [1e-6, 1e-3, 0.3 / b if b > 1 else 0.3, 0.9 / b if b > 2 else 0.45]:
                pts.append((a, b, x))
    # a, b <= 1
    for a in [0.001, 0.01, 0.05, 0.1, 0.3, 0.5, 0.9, 1.0]:
        for b in [0.001, 0.01, 0.1, 0.5, 1.0]:
            for x in [1e-8, 0.01, 0.1, 0.25, 0.31, 0.5, 0.8, 0.99]:
                pts.append((a, b, x))
    # one <= 1, other > 1
    for a in [0.01, 0.1, 0.5, 0.9]:
        for b in [1.5, 5.0, 12.0, 15.0, 16.0, 50.0, 1e3, 1e5]:
            for x in [1e-6, 1e-3, 0.01, 0.05, 0.09, 0.15, 0.25, 0.35, 0.7, 0.95]:
                pts.append((a, b, x))
                pts.append((b, a, 1 - x))
    # both > 1, b0 < 40
    for a in [1.5, 2.0, 5.5, 12.0, 15.0, 16.0, 30.0, 39.0, 100.0, 1e3]:
        for b in [1.5, 2.0, 3.3, 5.0, 10.0, 20.0, 30.0, 39.5]:
            for x in [0.01, 0.1, 0.3, 0.5, 0.72, 0.8, 0.9, 0.97]:
                pts.append((a, b, x))
    pts.append((30.0, 30.0, 0.9))
    # bfrac and basym
    for a in [40.0, 60.0, 100.0, 150.0, 1e3, 1e4, 1e5]:
        for b in [40.0, 60.0, 100.0, 150.0, 1e3, 1e4, 1e5]:
            m = a / (a + b)
            sd = math.sqrt(a * b / (a + b) ** 3)
            for k in [-8.0, -3.0, -1.0, -0.1, 0.0, 0.1, 1.0, 3.0, 8.0]:
                x = m + k * sd
                if 0 < x < 1:
                    pts.append((a, b, x))
    rows = []
    for a, b, x in pts:
        xs, ys = snap(x)
        if not (0.0 < xs < 1.0):
            continue
        # A tail of about min(a, b) next to 1 needs that many more digits.
        mpmath.mp.dps = 50 + max(0, int(-math.log10(min(a, b))))
        A, B, X = d(a), d(b), d(xs)
        I, Ic = beta_ratio(A, B, X)
        # Condition number of each tail for a relative change of x or y:
        # max(x, y) times the density over the tail.
        lbeta = mpmath.loggamma(A) + mpmath.loggamma(B) - mpmath.loggamma(A + B)
        dens = mpmath.exp((A - 1) * mpmath.log(X) + (B - 1) * mpmath.log1p(-X) - lbeta)
        scale = max(X, 1 - X) * dens
        mpmath.mp.dps = 50
        rows.append([beta_branch(a, b, xs, ys), float(a), float(b), xs, ys, I, Ic,
                     mpmath.mpf(float(scale / I)), mpmath.mpf(float(scale / Ic))])
    return rows


# ---------------------------------------------------------------- AS 187
def digami_rows():
    rows = []
    mpmath.mp.dps = 40
    for p in [0.3, 0.8, 1.5, 3.0, 7.0, 20.0]:
        for x in [0.05, 0.5, 1.0, 2.5, 6.0, 15.0, 40.0]:
            P, X = d(p), d(x)

            def inc(pp, xx):
                return mpmath.gammainc(pp, 0, xx, regularized=True)

            d1 = mpmath.diff(lambda t: inc(P, t), X, 1)
            d2 = mpmath.diff(lambda t: inc(P, t), X, 2)
            d3 = mpmath.diff(lambda s: inc(s, X), P, 1)
            d4 = mpmath.diff(lambda s: inc(s, X), P, 2)
            d5 = mpmath.diff(lambda s, t: inc(s, t), (P, X), (1, 1))
            d6 = inc(P, X)
            rows.append([float(x), float(p), d1, d2, d3, d4, d5, d6])
    mpmath.mp.dps = 50
    return rows


def main():
    write_rows(os.path.join(DATA, "transcendental_unary.csv"), "function,x,y,expected", unary_rows())
    write_rows(os.path.join(DATA, "polygamma.csv"), "x,order,expected", polygamma_rows())
    write_rows(os.path.join(DATA, "incomplete_gamma.csv"), "region,a,x,P,Q,cond", gamma_rows())
    write_rows(os.path.join(DATA, "incomplete_beta.csv"), "branch,a,b,x,y,I,Ic,cond,condc", beta_rows())
    write_rows(os.path.join(DATA, "digami.csv"), "x,p,d1,d2,d3,d4,d5,d6", digami_rows())


if __name__ == "__main__":
    main()
