"""Studentized maximum and maximum modulus upper tails by mpmath.

With Y_i = l_i Z + sqrt(1 - l_i^2) E_i (Z, E_i independent standard normal,
so corr(Y_i, Y_j) = l_i l_j) and s = sqrt(chi2_df / df) independent:
  maximum:  P(max_i Y_i / s > x)
            = 1 - int f(s) int phi(z) prod_i Phi((x s - l_i z)/c_i) dz ds,
  modulus:  P(max_i |Y_i| / s > x), factors Phi(a_i) - Phi(b_i),
            a_i = (x s - l_i z)/c_i, b_i = (-x s - l_i z)/c_i, c_i = sqrt(1 - l_i^2),
with f(s) = 2 (df/2)^(df/2) s^(df-1) exp(-df s^2/2) / Gamma(df/2) (df = inf:
s = 1). The outer integral is taken over t = log s. lambda = 0 reduces the
inner integral to Phi(xs)^k (maximum) or (2 Phi(xs) - 1)^k (modulus), a
single integral; k = 1 with lambda = 0 is Student's t, checked on the way.

Both integrals are composite 24-point Gauss-Legendre rules (nodes by Newton
in mpmath): inner panels at most 4 min(1, c_i) wide over 10 beyond the hull
of the points l_i x s; outer panels at most 5/sqrt(2 df) and 3/(x s)
wide where the chi density of s is within e^-75 of its peak; 25 significant
digits, the upper tail 1 - prod formed at that precision. With --check each value is
recomputed on panels of half the width and the larger difference printed.

Writes tests/data/studentized_maximum_mp.csv:
  kind (max|mod), lambdas (';'-separated), df, x, upper tail.
Run from the repository root: python3 tools/reference/gen_studentized_maximum.py
"""
import sys
from collections import Counter

from mpmath import mp, mpf, exp, log, loggamma, sqrt, erfc, betainc, inf

mp.dps = 25
CHECK = "--check" in sys.argv
NODES = None


def nodes():
    global NODES
    if NODES is None:
        n = 24
        pts = []
        for i in range(1, n + 1):
            # Newton on P_n from the Chebyshev-like start.
            x = mp.cos(mp.pi * (i - mpf(1) / 4) / (n + mpf(1) / 2))
            for _ in range(100):
                p0, p1 = mpf(1), x
                for j in range(2, n + 1):
                    p0, p1 = p1, ((2 * j - 1) * x * p1 - (j - 1) * p0) / j
                dp = n * (x * p1 - p0) / (x * x - 1)
                dx = p1 / dp
                x -= dx
                if abs(dx) < mpf(10) ** (-mp.dps - 5):
                    break
            pts.append((x, 2 / ((1 - x * x) * dp * dp)))
        NODES = pts
    return NODES


def gl(f, a, b):
    h, c = (b - a) / 2, (b + a) / 2
    return h * sum(w * f(c + h * x) for x, w in nodes())


def panels(points, lo, hi, width):
    """Panels from lo to hi, cut at the given points, each at most width(t)
    wide (width evaluated at both ends of a trial panel)."""
    cuts = sorted(set([lo, hi] + [p for p in points if lo < p < hi]))
    out = []
    for a, b in zip(cuts[:-1], cuts[1:]):
        t = a
        while t < b:
            h = min(width(t), b - t)
            h = min(h, width(t + h))
            end = b if b - (t + h) < h / 8 else t + h
            out.append((t, end))
            t = end
    return out


def Q(x):
    return erfc(x / sqrt(2)) / 2


def phi(z):
    return exp(-z * z / 2) / sqrt(2 * mp.pi)


def inner_upper(kind, groups, w, refine):
    """1 - E_Z prod_j F_j(Z)^m_j at w = x s."""
    zero = [m for l, m in groups if l == 0]
    rest = [(l, m, sqrt(1 - l * l)) for l, m in groups if l != 0]
    m0 = zero[0] if zero else 0
    f0 = (1 - Q(w)) ** m0 if kind == "max" else (1 - 2 * Q(w)) ** m0
    if not rest:
        return 1 - f0

    def prod(z):
        p = mpf(1)
        for l, m, c in rest:
            a = (w - l * z) / c
            if kind == "max":
                p *= (1 - Q(a)) ** m
            else:
                b = (-w - l * z) / c
                p *= (Q(b) - Q(a)) ** m
        return p

    top = max([abs(l) * abs(w) for l, m, c in rest] + [0])
    # The modulus integrand is even in z (F_j depends on l_j z only through
    # its sign, which swapping a_j and -b_j undoes).
    lo, hi = (-top - 10 if kind == "max" else mpf(0)), top + 10
    feats = [0]
    cmin = min(c for l, m, c in rest)
    for l, m, c in rest:
        feats += [l * w, -l * w, w / l, -w / l]
    width = lambda z: min(mpf(4), 4 * cmin) / refine
    total = mpf(0)
    for a, b in panels(feats, lo, hi, width):
        total += gl(lambda z: phi(z) * (1 - f0 * prod(z)), a, b)
    return total if kind == "max" else 2 * total


def upper(kind, lambdas, df, x, refine=1):
    groups = sorted(Counter(lambdas).items())
    if df == inf:
        return inner_upper(kind, groups, x, refine)
    dfm = mpf(df)
    c = log(2) + dfm / 2 * log(dfm / 2) - loggamma(dfm / 2)
    g = lambda t: exp(c + dfm * t - dfm * exp(2 * t) / 2)
    sd = 1 / sqrt(2 * dfm)
    # Where log g is 75 below its peak at t = 0.
    drop = lambda t: dfm * (exp(2 * t) / 2 - t - mpf(1) / 2) - 75
    lo = mp.findroot(drop, (mpf(-200), mpf(0)), solver="bisect")
    hi = mp.findroot(drop, (mpf(0), mpf(10)), solver="bisect")
    feats = [mpf(0), -log(abs(x)) if x != 0 else mpf(0)]
    width = lambda t: min(mpf(2), 5 * sd, mpf(3) / max(abs(x) * exp(t), 1)) / refine
    total = mpf(0)
    for a, b in panels(feats, lo, hi, width):
        total += gl(lambda t: g(t) * inner_upper(kind, groups, x * exp(t), refine), a, b)
    return total


def t_upper(x, df):
    df = mpf(df)
    return betainc(df / 2, mpf(1) / 2, 0, df / (df + x * x), regularized=True) / 2


L2 = 1 / sqrt(mpf(2))
DFS = [2.5, 3, 5, 10, 30, 120, 1000, inf]
POINTS = []
# lambda = 0: single integrals (and closed forms at df = inf).
for kind in ("max", "mod"):
    for k in (1, 2, 5, 20):
        for df in DFS:
            for x in (1.37, 2.71, 4.63):
                POINTS.append((kind, [mpf(0)] * k, df, x))
# Many-to-one comparisons: every lambda 1/sqrt(2).
for kind in ("max", "mod"):
    for k in (2, 4, 9):
        for df in (3, 10, 30, 120, 1000, inf):
            for x in (2.13, 3.37):
                POINTS.append((kind, [L2] * k, df, x))
# Mixed lambdas with repeats (the order as given; the library sorts).
MIXED = [[mpf("0.8"), mpf("0.3"), mpf("0.8"), mpf("0.5"), mpf("0.3"), mpf("0.8")],
         [mpf("0.9"), mpf("-0.4"), mpf(0), mpf("0.6"), mpf("-0.4")]]
for kind in ("max", "mod"):
    for lam in MIXED:
        for df in (5, 30, inf):
            for x in (2.43, 3.81):
                POINTS.append((kind, lam, df, x))
# Far tails and a strong correlation.
POINTS += [("max", [mpf("0.5")] * 3, inf, 7.0), ("mod", [mpf("0.5")] * 3, 10, 9.0),
           ("mod", [mpf("0.99"), mpf("0.2")], 10, 3.1), ("max", [mpf("0.99"), mpf("0.2")], 30, 2.6),
           ("max", [mpf("0.6")] * 4, 10, 0.0), ("max", [mpf("0.6"), mpf("0.2")], 10, -0.5)]

if __name__ == "__main__":
    only = [a for a in sys.argv[1:] if a != "--check"]
    with open("tests/data/studentized_maximum_mp.csv", "w") as out:
        out.write("# From tools/reference/gen_studentized_maximum.py (mpmath, 25 digits).\n")
        out.write("# kind,lambdas,df,x,upper\n")
        for kind, lam, df, x in POINTS:
            p = upper(kind, lam, df, mpf(x))
            if all(l == 0 for l in lam) and len(lam) == 1 and df != inf and x > 0:
                ref = t_upper(mpf(x), df) * (1 if kind == "max" else 2)
                assert abs(p - ref) < mpf(10) ** -20 * ref, (kind, df, x, p, ref)
            if CHECK:
                p2 = upper(kind, lam, df, mpf(x), 2)
                print(kind, df, x, mp.nstr(abs(p2 - p) / p, 3), file=sys.stderr)
            lams = ";".join(mp.nstr(l, 20) for l in lam)
            out.write("%s,%s,%s,%s,%s\n" % (kind, lams, df, x, mp.nstr(p, 20)))
            out.flush()
