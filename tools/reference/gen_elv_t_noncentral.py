"""Reference data for the noncentral t and the complementary Owen's T.

P(T <= t) for T = (Z + delta)/sqrt(V/df), V chi-square with df degrees of
freedom, equals E[Phi(t W - delta)] with W = sqrt(V/df), and the upper tail
E[Q(t W - delta)]; both are integrated by mpmath.quad at 40 digits around the
peak of their own integrand, so each tail keeps its relative accuracy however
small it is. Tha_c(h, a) is the integral of phi(x) Q(a x) from h to infinity.

Writes tests/data/elv_t_noncentral.csv, tests/data/elv_owen.csv and
tests/data/elv_t_expansion.csv (the far lower tail, t < 0 < delta mostly, of
small integer df where the expansion in m/(m + t^2) is used).
Run with /usr/bin/python3 from tools/reference.
"""
import os
import sys

import mpmath
from mpmath import mp, mpf

from refdata import d, write_rows

mp.dps = 30
OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")


def log_w_density(w, df):
    k = df / 2
    return (mpmath.log(2) + k * mpmath.log(k) - mpmath.loggamma(k)
            + (df - 1) * mpmath.log(w) - k * w * w)


def log_phi_lower(y):
    return mpmath.log(mpmath.ncdf(y))


def log_phi_upper(y):
    return mpmath.log(mpmath.ncdf(-y))


def tail(t, df, delta, upper):
    lp = log_phi_upper if upper else log_phi_lower

    def g(w):
        return log_w_density(w, df) + lp(t * w - delta)

    # locate the peak of g on (0, inf): coarse log grid, then golden section
    grid = [mpmath.exp(mpf(i) / 10) for i in range(-100, 60)]
    vals = [g(w) for w in grid]
    i = max(range(len(grid)), key=lambda j: vals[j])
    lo = grid[max(i - 1, 0)] if i > 0 else mpf(0)
    hi = grid[min(i + 1, len(grid) - 1)]
    phi_ = (mpmath.sqrt(5) - 1) / 2
    for _ in range(90):
        a = hi - phi_ * (hi - lo)
        b = lo + phi_ * (hi - lo)
        if g(a) > g(b):
            hi = b
        else:
            lo = a
    peak = (lo + hi) / 2
    gp = g(peak)
    hstep = peak * mpf(10) ** -8
    second = (g(peak + hstep) - 2 * gp + g(peak - hstep)) / hstep ** 2
    sigma = 1 / mpmath.sqrt(-second) if second < 0 else peak / 4
    pts = [peak + k * sigma for k in range(-48, 49, 4)]
    pts = [p for p in pts if p > 0]
    pts = [mpf(0)] + pts + [pts[-1] * 2 + 1, mpmath.inf]

    def f(w):
        if w <= 0:
            return mpf(0)
        return mpmath.exp(g(w) - gp)

    return mpmath.exp(gp) * mpmath.quad(f, pts, maxdegree=8)


def gen_nct():
    rows = []
    dfs = [1.0, 1.5, 2.0, 3.0, 5.0, 8.0, 12.0, 15.0, 30.0, 100.0, 1000.0, 10000.0, 1e6]
    deltas = [-40.0, -21.3, -5.0, -1.0, 0.5, 1.0, 3.0, 10.0, 21.3, 22.0, 40.0]
    ts = [-60.0, -12.0, -3.0, -1.0, 0.0, 0.7, 2.0, 8.0, 30.0]
    for df in dfs:
        for delta in deltas:
            for t in ts:
                lo = tail(d(t), d(df), d(delta), False)
                up = tail(d(t), d(df), d(delta), True)
                rows.append([repr(t), repr(df), repr(delta), lo, up])
        print(df, file=sys.stderr)
    write_rows(os.path.join(OUT, "elv_t_noncentral.csv"), "t,df,delta,lower,upper", rows)


def tha_c(h, a):
    h, a = d(h), d(a)
    # scaled to 1 at the start: quad stops on an absolute error estimate
    x0 = max(h, mpf(0))
    base = mpmath.npdf(x0) * mpmath.ncdf(-a * x0)
    f = lambda x: mpmath.npdf(x) * mpmath.ncdf(-a * x) / base
    # finite panels only (quad over [x, inf) misjudges its error here), up
    # to where phi(x) has fallen by e^-150 from its value at max(h, 0)
    start = max(h, mpf(0))
    end = start + mpmath.sqrt(start * start + 300) - start
    scale = 1 / (abs(h) * (1 + a * a) + 1) / 8
    steps = [scale * 2 ** (k / mpf(2)) for k in range(0, 80)]
    steps = [s for s in steps if s < end] + [end]
    pts = [start + s for s in steps]
    pts = [start] + pts
    if h < 0:
        pts = [h + (-h) * k / 16 for k in range(16)] + pts
    return base * mpmath.quad(f, pts, maxdegree=10)


def check_owen():
    # For a = 1 the integral is Q(h)^2/2 exactly.
    for h in (0.5, 10.0, 30.0):
        exact = mpmath.ncdf(-d(h)) ** 2 / 2
        assert abs(tha_c(h, 1.0) / exact - 1) < mpf(10) ** -25, h


def owen_rows():
    """The grid of the first version, then rows on every region of Tha_c and
    its borders (a = 0.75, 1, 1.333333), g = (a h)^2/2 or h^2/2 around 1,
    h = 0, negative h, and large h with values from 1e-100 down to 1e-300."""
    hs = [-3.0, -0.5, 0.0, 0.1, 0.5, 1.0, 2.0, 5.0, 10.0, 20.0, 30.0]
    As = [0.01, 0.3, 0.74, 0.75, 0.9, 1.0, 1.2, 1.333333, 1.34, 3.0, 10.0, 100.0]
    cases = [(h, a) for h in hs for a in As]
    borders = [0.7499999999, 0.75, 0.7500000001, 0.99, 0.9999999999, 1.0, 1.0000000001, 1.01,
               1.3333329999, 1.333333, 1.3333330001, 4.0 / 3.0]
    cases += [(h, a) for h in (0.0, 0.3, 1.5, 3.0, 4.5, 7.0, 15.0, 26.0) for a in borders]
    # g = (a h)^2/2 around 1 in the gamma series, directly and reflected.
    root2 = 2.0 ** 0.5
    for a in (1.5, 2.0, 5.0):
        cases += [(root2 / a * f, a) for f in (0.9, 0.999999, 1.0, 1.000001, 1.1)]
    for a in (0.2, 0.5, 0.7):
        cases += [(root2 * f, a) for f in (0.9, 0.999999, 1.0, 1.000001, 1.1)]
    cases += [(-h, a) for h in (1e-8, 1.0, 8.0, 37.0) for a in (0.5, 0.8, 1.2, 2.0, 1e3)]
    cases += [(0.0, a) for a in (1e-50, 1e-5, 0.5, 2.0, 1e5, 1e50)]
    # Far tails: Tha_c is about exp(-h^2 (1 + a^2)/2), so h^2 (1 + a^2) = 2 L
    # gives values near e^-L.
    for a in (0.01, 0.3, 0.74, 0.8, 0.95, 1.0, 1.05, 1.3, 1.4, 3.0, 30.0):
        for L in (230.0, 460.0, 640.0, 686.0):
            cases.append((float(mpmath.sqrt(2 * L / (1 + mpf(a) ** 2))), a))
    return cases


def owen_check(h, a, value):
    """Second evaluation of Tha_c: 1/(2 pi) times the integral over (a, inf)
    of exp(-h^2 (1 + t^2)/2)/(1 + t^2), with 1/2 - Q(-h) added for h < 0."""
    from derive_owen_series import reference
    h, a = d(h), d(a)
    other = reference(h, a) if h >= 0 else mpmath.ncdf(-h) - mpf(1) / 2 + reference(-h, a)
    assert abs(other - value) <= mpf(10) ** -25 * value, (h, a)


def gen_owen():
    check_owen()
    rows = []
    for h, a in owen_rows():
        if h == 0.0:
            # exact: T(0, a) = atan(a)/(2 pi)
            value = mpmath.atan(1 / d(a)) / (2 * mpmath.pi)
        else:
            value = tha_c(h, a)
        owen_check(h, a, value)
        rows.append([repr(h), repr(a), value])
    write_rows(os.path.join(OUT, "elv_owen.csv"), "h,a,Tha_c", rows)


def gen_expansion():
    """Far-tail rows: the tail itself, the value of the four-term expansion
    in m/(m + t^2) as t_expansion_approx forms it (exact arithmetic on the
    derived tables), and that sum's condition number."""
    from derive_t_expansion import expansion_parts, tables

    table = tables()
    rows = []
    deltas = [-5.0, -3.0, -1.0, 0.5, 1.0, 2.0, 3.0, 5.0, 8.0, 10.0, 15.0, 21.3]
    for df in [float(m) for m in range(1, 13)] + [2.5, 9.5]:
        if df == 1.0:
            ts = [-10.0, -50.0, -1000.0]
        elif df < 7.0:
            ts = [-10.0, -20.0, -50.0, -1000.0]
        else:
            ts = [-25.5, -40.0, -100.0, -1000.0]
        _, scale, Pi, Ri = table[int(df) - 1]
        for t in ts:
            for delta in deltas:
                value, condition = expansion_parts(d(t), d(df), d(delta), scale, Pi, Ri)
                rows.append([repr(t), repr(df), repr(delta), tail(d(t), d(df), d(delta), False),
                             value, condition])
        print(df, file=sys.stderr)
    write_rows(os.path.join(OUT, "elv_t_expansion.csv"), "t,df,delta,lower,expansion,condition",
               rows)


if __name__ == "__main__":
    mp.dps = 40
    which = sys.argv[1:] or ["owen", "nct", "expansion"]
    if "owen" in which:
        gen_owen()
    if "nct" in which:
        gen_nct()
    if "expansion" in which:
        gen_expansion()
