"""Studentized maximum and maximum modulus with lambdas near 1 by mpmath.

Lambdas 0.99, 0.999 and 0.9999 make the factor Phi((x s - l z)/c), c = sqrt(1 - l^2),
a step in z of width c/l at z = x s / l, sharpened further by its power m (the
count of that lambda). The truth is the integral of gen_studentized_maximum.py:
  maximum:  1 - int f(s) int phi(z) prod_j Phi(a_j)^m_j dz ds,
  modulus:  1 - int f(s) int phi(z) prod_j (Phi(a_j) - Phi(b_j))^m_j dz ds,
  a_j = (x s - l_j z)/c_j, b_j = (-x s - l_j z)/c_j,
f the density of s = sqrt(chi2_df/df) (df = inf: s = 1). Here the inner z-range
is cut where each a_j (and b_j) crosses -12, -6, -3, 0, 3, 6, 12, and the panels
between those cuts are at most c_j/l_j wide, so that 24-point Gauss-Legendre
rules resolve every step; the outer panels (over t = log s) are those of
gen_studentized_maximum.py. Each value is recomputed on panels of half the
width (inner and outer) and the relative difference kept as its error estimate
(all below 1e-14, asserted).

The points x are placed near the upper tails 0.5, 0.05 and 0.001 by a double
precision estimate (numpy), rounded to four digits; the reference value is the
mpmath integral at that x.

Writes tests/data/studentized_maximum_near1_mp.csv:
  kind (max|mod), lambdas (value*count, '+'-separated), df, x, upper tail, error estimate.
Run from the repository root: python3 tools/reference/gen_studentized_maximum_near1.py
"""
import math
import os
import sys
from multiprocessing import Pool

import numpy as np
from mpmath import mp, mpf, exp, log, loggamma, sqrt, inf
from scipy.optimize import brentq
from scipy.special import ndtr, log_ndtr, gammaln

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
from gen_studentized_maximum import Q, phi, gl, panels  # noqa: E402

mp.dps = 25

# (lambda, count) groups.
SETS = [[(l, k)] for l in ("0.99", "0.999", "0.9999") for k in (2, 10, 40, 100)]
SETS += [[("0.999", 20), ("0.3", 20)], [("0.99", 4), ("0.5", 3), ("0.1", 3)],
         [("0.9999", 30), ("0.99", 30), ("0.9", 40)]]
DFS = [5, 20, 120, inf]
TAILS = [0.5, 0.05, 0.001]
# The sets also taken at finite df (at the x of the upper tail 0.05 for df = inf).
FINITE = (3, 5, 11, 12, 13)
CUTS = (-12, -6, -3, 0, 3, 6, 12)


def inner_upper(kind, groups, w, refine):
    """1 - E_Z prod_j F_j(Z)^m_j at w = x s, every factor's step resolved."""
    rest = [(l, m, sqrt(1 - l * l)) for l, m in groups]

    def integrand(z):
        p = mpf(1)
        for l, m, c in rest:
            a = (w - l * z) / c
            f = 1 - Q(a) if kind == "max" else Q((-w - l * z) / c) - Q(a)
            p *= f ** m
        return phi(z) * (1 - p)

    top = max(l * abs(w) for l, m, c in rest)
    lo, hi = (-top - 12 if kind == "max" else mpf(0)), top + 12
    feats = [mpf(0)]
    steps = []
    for l, m, c in rest:
        for t in CUTS:
            feats += [(w - t * c) / l, (-w - t * c) / l]
        steps.append(((w - 12 * c) / l, (w + 12 * c) / l, (-w - 12 * c) / l, (-w + 12 * c) / l, c / l))

    def width(z):
        h = mpf(2)
        for a0, a1, b0, b1, s in steps:
            if a0 <= z <= a1 or (kind == "mod" and b0 <= z <= b1):
                h = min(h, s)
        return h / refine

    total = sum(gl(integrand, a, b) for a, b in panels(feats, lo, hi, width))
    return total if kind == "max" else 2 * total


def upper(kind, groups, df, x, refine=1):
    if df == inf:
        return inner_upper(kind, groups, x, refine)
    dfm = mpf(df)
    c = log(2) + dfm / 2 * log(dfm / 2) - loggamma(dfm / 2)
    g = lambda t: exp(c + dfm * t - dfm * exp(2 * t) / 2)
    sd = 1 / sqrt(2 * dfm)
    drop = lambda t: dfm * (exp(2 * t) / 2 - t - mpf(1) / 2) - 60
    lo = mp.findroot(drop, (mpf(-200), mpf(0)), solver="bisect")
    hi = mp.findroot(drop, (mpf(0), mpf(10)), solver="bisect")
    feats = [mpf(0), -log(abs(x))]
    width = lambda t: min(mpf(2), 5 * sd, mpf(3) / max(abs(x) * exp(t), 1)) / refine
    total = mpf(0)
    for a, b in panels(feats, lo, hi, width):
        total += gl(lambda t: g(t) * inner_upper(kind, groups, x * exp(t), refine), a, b)
    return total


GL_X, GL_W = np.polynomial.legendre.leggauss(24)


def fpanels(cuts, lo, hi, width):
    """Panels from lo to hi cut at the given points, at most width(t) wide."""
    cuts = sorted(set([lo, hi] + [p for p in cuts if lo < p < hi]))
    out = []
    for a, b in zip(cuts[:-1], cuts[1:]):
        n = int(np.ceil((b - a) / min(width(a), width(b), width(0.5 * (a + b))) - 1e-9))
        e = np.linspace(a, b, max(n, 1) + 1)
        out += list(zip(e[:-1], e[1:]))
    return out


def gl_nodes(pans):
    a = np.array([p[0] for p in pans])[:, None]
    b = np.array([p[1] for p in pans])[:, None]
    return ((a + b) / 2 + (b - a) / 2 * GL_X).ravel(), ((b - a) / 2 * GL_W).ravel()


def finner(kind, groups, w, refine):
    """inner_upper in double precision: the same cuts and panel widths, the
    upper tail formed as -expm1(sum m_j log F_j) with log Phi from log_ndtr."""
    top = max(l * abs(w) for l, m in groups)
    lo, hi = (-top - 12 if kind == "max" else 0.0), top + 12
    feats, steps = [0.0], []
    for l, m in groups:
        c = np.sqrt((1 - l) * (1 + l))
        for t in CUTS:
            feats += [(w - t * c) / l, (-w - t * c) / l]
        steps.append(((w - 12 * c) / l, (w + 12 * c) / l, (-w - 12 * c) / l, (-w + 12 * c) / l, c / l))

    def width(z):
        h = 2.0
        for a0, a1, b0, b1, s in steps:
            if a0 <= z <= a1 or (kind == "mod" and b0 <= z <= b1):
                h = min(h, s)
        return h / refine

    z, wt = gl_nodes(fpanels(feats, lo, hi, width))
    logp = np.zeros_like(z)
    for l, m in groups:
        c = np.sqrt((1 - l) * (1 + l))
        a = (w - l * z) / c
        if kind == "max":
            logp += m * log_ndtr(a)
        else:
            b = (-w - l * z) / c
            q = ndtr(-a) + ndtr(b)
            logp += m * np.where(q < 0.5, np.log1p(-np.minimum(q, 0.5)),
                                 np.log(np.maximum(ndtr(a) - ndtr(b), 1e-300)))
    v = wt * np.exp(-z * z / 2) / np.sqrt(2 * np.pi) * -np.expm1(logp)
    return (1.0 if kind == "max" else 2.0) * math.fsum(v)


def fupper(kind, groups, df, x, refine=1):
    """upper() in double precision (scipy's normal cdf)."""
    if df == inf:
        return finner(kind, groups, x, refine)
    a = df / 2.0
    c = np.log(2) + a * np.log(a) - gammaln(a)
    drop = lambda t: df * (np.exp(2 * t) / 2 - t - 0.5) - 60
    lo, hi = brentq(drop, -200, 0), brentq(drop, 0, 10)
    sd = 1 / np.sqrt(2 * df)
    width = lambda t: min(2.0, 5 * sd, 3 / max(abs(x) * np.exp(t), 1)) / refine
    t, wt = gl_nodes(fpanels([0.0, -np.log(abs(x))], lo, hi, width))
    v = [wt[i] * np.exp(c + df * t[i] - a * np.exp(2 * t[i])) * finner(kind, groups, x * np.exp(t[i]), refine)
         for i in range(len(t))]
    return math.fsum(v)


def place(kind, groups, tail):
    f = lambda x: finner(kind, groups, x, 0.5) - tail
    return float("%.4g" % brentq(f, -5.0 if kind == "max" else 0.01, 60.0, xtol=1e-6))


def label(groups):
    return "+".join("%s*%d" % (l, m) for l, m in groups)


def row(point):
    kind, groups, df, x = point
    g = [(mpf(l), m) for l, m in groups]
    fg = [(float(l), m) for l, m in groups]
    if df == inf:
        p, p2 = upper(kind, g, df, mpf(x)), upper(kind, g, df, mpf(x), 2)
        # The double precision engine of the finite df rows, checked here.
        d = abs(fupper(kind, fg, df, x, 2) - p2) / p2
        assert d < 1e-13, (point, d)
    else:
        p, p2 = mpf(fupper(kind, fg, df, x)), mpf(fupper(kind, fg, df, x, 2))
    err = abs(p2 - p) / p2
    if not err < mpf(10) ** -13:
        print("left out:", point, mp.nstr(err, 2), file=sys.stderr)
        return ""
    return "%s,%s,%s,%s,%s,%s\n" % (kind, label(groups), "inf" if df == inf else df, x, mp.nstr(p2, 20), mp.nstr(err, 2))


def points():
    out = []
    for kind in ("max", "mod"):
        for i, groups in enumerate(SETS):
            fg = [(float(l), m) for l, m in groups]
            for tail in TAILS:
                x = place(kind, fg, tail)
                out.append((kind, groups, inf, x))
                if tail == 0.05 and i in FINITE:
                    out += [(kind, groups, df, x) for df in DFS if df != inf]
    return out


if __name__ == "__main__":
    pts = points()
    if len(sys.argv) > 1:
        pts = pts[: int(sys.argv[1])]
    # The double precision rows (finite df) first; rows written as they come.
    pts.sort(key=lambda p: p[2] == inf)
    with Pool(2) as pool, open("tests/data/studentized_maximum_near1_mp.csv", "w") as out:
        out.write("# From tools/reference/gen_studentized_maximum_near1.py (mpmath at df = inf,\n")
        out.write("# scipy double precision checked against it at finite df).\n")
        out.write("# kind,lambdas (value*count),df,x,upper,error estimate\n")
        for r in pool.imap(row, pts, chunksize=1):
            out.write(r)
            out.flush()
