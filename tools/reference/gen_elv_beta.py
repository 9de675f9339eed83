#!/usr/bin/env python3
"""Reference values for the beta, binomial and F routines of the ELV family.

All values are computed with mpmath at 50 significant digits from positive
series only (no cancellation):
  I_x(a,b) = x^a (1-x)^b / (a B(a,b)) * sum_j (a+b)_j / (a+1)_j x^j,
the smaller tail by this series on its own side (1 - I_x(a,b) = I_(1-x)(b,a)),
the other as 1 minus it. Noncentral tails are Poisson mixtures summed term by
term: the lower tail downwards from an index far above the mean with
I(j-1) = I(j) + x^A (1-x)^b / (A B(A,b)), the upper tail upwards with the
mirrored recurrence, so that each tail is a sum of positive terms.

Writes, under tests/data/:
  elv_beta_df.csv        x,a,b,lower,upper,density
  elv_beta_ncdf.csv      x,a,b,L,lower,upper
  elv_binomial_df.csv    k,n,prob,lower,upper,mass
  elv_F_df.csv           x,df1,df2,L,lower,upper          (L = 0: central)
  elv_beta_quant.csv     form,p,a,b,x,1-x,slope  (I_x(a,b) = p for the lower
                         form, 1 - p for the upper; slope = density at x over p)
  elv_F_quant.csv        form,p,df1,df2,q,slope
  elv_binomial_quant.csv form,p,n,prob,k,f,mass  (mass = P(X = k))
The seeds are fixed, so the files are reproducible.
Run: /usr/bin/python3 tools/reference/gen_elv_beta.py
"""
import os
import random
import sys

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import d, write_rows  # noqa: E402

mpmath.mp.dps = 50
DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")


def log_beta(a, b):
    return mpmath.loggamma(a) + mpmath.loggamma(b) - mpmath.loggamma(a + b)


MAX_TERMS = 30000


class SlowSeries(Exception):
    """The series needs too many terms at this point; the point is skipped."""


def lower_series(x, a, b):
    """I_x(a,b) by the positive hypergeometric series (x below the mean)."""
    if x == 0:
        return mpf(0)
    lpre = a * mpmath.log(x) + b * mpmath.log1p(-x) - mpmath.log(a) - log_beta(a, b)
    term = mpf(1)
    total = mpf(1)
    j = 0
    eps = mpf(10) ** (-mpmath.mp.dps)
    while True:
        j += 1
        if j > MAX_TERMS:
            raise SlowSeries()
        term *= (a + b + j - 1) * x / (a + j)
        total += term
        if term < eps * total and (a + b + j) * x < (a + j):
            break
    return mpmath.exp(lpre) * total


def tail_by_quadrature(x, a, b, lower):
    """One tail of I_x(a,b) by tanh-sinh quadrature of the density, on
    intervals that shrink geometrically towards x, where the integrand of
    a far tail has its weight."""
    lb = log_beta(a, b)

    def f(t):
        return mpmath.exp((a - 1) * mpmath.log(t) + (b - 1) * mpmath.log1p(-t) - lb)

    scales = [mpf(10) ** (-m) for m in range(30, -1, -1)]
    if lower:
        pts = [mpf(0)] + [x - x * s for s in reversed(scales)] + [x]
    else:
        pts = [x] + [x + (1 - x) * s for s in scales]
    pts = sorted(set(pts))
    return mpmath.quad(f, pts)


def beta_pair(x, a, b):
    """(I_x(a,b), 1 - I_x(a,b)), each to full relative precision."""
    try:
        return beta_pair_series(x, a, b)
    except SlowSeries:
        lower_small = x * (a + b) <= a
        small = tail_by_quadrature(x, a, b, lower_small)
        return (small, 1 - small) if lower_small else (1 - small, small)


def beta_pair_series(x, a, b):
    if x <= 0:
        return mpf(0), mpf(1)
    if x >= 1:
        return mpf(1), mpf(0)
    lower_small = x * (a + b) <= a
    # Sum on the side whose terms fall off fastest; when that is the larger
    # tail, work with enough extra digits for the smaller one to survive the
    # subtraction.
    lower_side = (a + b) * x / (a + 1) <= (a + b) * (1 - x) / (b + 1)
    if lower_side == lower_small:
        if lower_small:
            lo = lower_series(x, a, b)
            return lo, 1 - lo
        up = lower_series(1 - x, b, a)
        return 1 - up, up
    xs, aa, bb = (x, a, b) if lower_small else (1 - x, b, a)
    small_log = aa * mpmath.log(xs) + bb * mpmath.log1p(-xs) - mpmath.log(aa) - log_beta(aa, bb)
    extra = int(max(0, -small_log / mpmath.log(10))) + 20
    with mpmath.extradps(extra):
        big = lower_series(1 - xs, bb, aa)
        small = 1 - big
    if small <= 0:
        raise SlowSeries()
    return (+small, 1 - small) if lower_small else (1 - small, +small)


def beta_density(x, a, b):
    return mpmath.exp((a - 1) * mpmath.log(x) + (b - 1) * mpmath.log1p(-x) - log_beta(a, b))


def g_term(x, A, b):
    """I_x(A,b) - I_x(A+1,b)."""
    return mpmath.exp(A * mpmath.log(x) + b * mpmath.log1p(-x) - mpmath.log(A) - log_beta(A, b))


def noncentral_pair(x, a, b, L):
    """Lower and upper tail of the Poisson(L) mixture of I_x(a+j, b)."""
    if L == 0:
        return beta_pair(x, a, b)
    eps = mpf(10) ** (-mpmath.mp.dps + 5)
    # Lower tail: downwards from J, where the Poisson tail above is negligible.
    J = int(L + 20 * mpmath.sqrt(L) + 200)
    I = beta_pair(x, a + J, b)[0]
    w = mpmath.exp(-L + J * mpmath.log(L) - mpmath.loggamma(J + 1))
    g = g_term(x, a + J - 1, b) if a + J - 1 > 0 else None  # I(J-1) - I(J)
    lower = mpf(0)
    for j in range(J, -1, -1):
        lower += w * I
        if j == 0:
            break
        A = a + j - 1  # g(A) = I_x(A,b) - I_x(A+1,b); g(A-1) = g(A) A / (x (A+b-1))
        I += g if A > 0 else 1 - I
        if A > 1:
            g = g * A / (x * (A + b - 1))
        w *= j / L
    # Upper tail: upwards from 0 until the terms are negligible past the mean.
    U = beta_pair(x, a, b)[1]
    w = mpmath.exp(-L)
    g = g_term(x, a, b) if a > 0 else mpf(0)
    upper = mpf(0)
    j = 0
    while True:
        upper += w * U
        if j > L and w * U < eps * upper:
            break
        U += g
        A = a + j
        g = g * x * (A + b) / (A + 1) if A > 0 else g_term(x, mpf(1), b)
        j += 1
        w *= L / j
    return lower, upper


def binomial_pair(k, n, p):
    """P(X <= k), P(X > k) and P(X = k)."""
    up, lo = beta_pair(mpf(p), mpf(k + 1), mpf(n - k)) if k < n else (mpf(0), mpf(1))
    if k == n:
        lo, up = mpf(1), mpf(0)
    mass = mpmath.exp(mpmath.loggamma(n + 1) - mpmath.loggamma(k + 1) - mpmath.loggamma(n - k + 1) +
                      k * mpmath.log(p) + (n - k) * mpmath.log1p(-p))
    return lo, up, mass


def f_arguments(x, df1, df2):
    c, d2 = mpf(df1) / 2, mpf(df2) / 2
    return c * x / (d2 + c * x), c, d2


def beta_rows(rng):
    rows = []
    shapes = [1e-3, 0.01, 0.1, 0.5, 1.0, 1.5, 2.0, 3.5, 10.0, 30.5, 100.0, 1e3, 1e4, 1e5, 1e6,
              1e7, 9e7]
    # Tail probabilities spread from the centre to 1e-300.
    targets = [0.5, 0.3, 0.1, 1e-3, 1e-6, 1e-12, 1e-30, 1e-80, 1e-150, 1e-250, 1e-300, 1e-320]
    points = []
    for _ in range(150):
        a = min(rng.choice(shapes) * rng.choice([1.0, 1.37]), 9e7)
        b = rng.choice(shapes) * rng.choice([1.0, 0.71])
        points.append((a, b))
    for a, b in points:
        mean = a / (a + b)
        sd = mpmath.sqrt(a * b / ((a + b) ** 2 * (a + b + 1)))
        for _ in range(3):
            kind = rng.random()
            if kind < 0.35:
                x = float(mean + rng.gauss(0, 1) * 4 * sd)
            elif kind < 0.7:
                # log-uniform in x or 1 - x
                e = rng.uniform(-300, 0)
                x = 10 ** e if rng.random() < 0.5 else 1 - 10 ** max(e, -16)
            else:
                x = float(mean * (1 + rng.choice([-1, 1]) * rng.uniform(0, 1)))
            x = min(max(x, 1e-300), 1 - 1e-16)
            if not 0 < x < 1:
                continue
            xm = d(x)
            try:
                lo, up = beta_pair(xm, d(a), d(b))
            except SlowSeries:
                continue
            rows.append([repr(x), repr(float(a)), repr(float(b)), lo, up, beta_density(xm, d(a), d(b))])
    # Fixed edge points: x = 1/2, equal shapes, integer shapes, unequal extremes.
    for x, a, b in [(0.5, 3.0, 3.0), (0.5, 0.5, 2.0), (0.5, 1e7, 1e7), (0.25, 1.0, 1.0),
                    (1e-300, 1e-3, 1e-3), (1e-10, 9e7, 1e-3), (0.999999, 1e-3, 9e7),
                    (1e-8, 1e-3, 9e7), (2e-9, 0.5, 9e7), (0.3, 2.0, 5.0), (0.7, 5.0, 2.0)]:
        lo, up = beta_pair(d(x), d(a), d(b))
        rows.append([repr(x), repr(a), repr(b), lo, up, beta_density(d(x), d(a), d(b))])
    return rows


def ncdf_rows(rng):
    rows = []
    cases = []
    for _ in range(70):
        a = rng.choice([0.5, 1.0, 2.5, 10.0, 100.0, 1e3])
        b = rng.choice([0.5, 1.0, 3.0, 20.0, 500.0, 1e4])
        L = rng.choice([0.5, 2.0, 10.0, 100.0, 1e3, 1e4])
        # centre of the mixture and a spread around it
        m = (a + L) / (a + b + L)
        sd = mpmath.sqrt(m * (1 - m) / (a + b + L + 1)) * (1 + mpmath.sqrt(L) / (a + b + L) ** 0.5)
        x = float(m + rng.gauss(0, 1) * 5 * sd)
        if rng.random() < 0.2:
            x = 10 ** rng.uniform(-30, -1)
        x = min(max(x, 1e-300), 1 - 1e-12)
        cases.append((x, a, b, L))
    cases += [(0.5, 2.0, 2.0, 1.0), (0.5, 3.0, 7.0, 50.0), (0.2, 5.0, 5.0, 1e4), (0.999, 5.0, 5.0, 1e4)]
    # Tiny shapes, where the first sum passes 0.9 and hands over to the other.
    cases += [(0.02395465292146781, 0.005301858349192932, 0.28769745571047844, 0.0019655474078704486),
              (0.06950424, 0.0023779449003527593, 0.1611896785986274, 0.06937535972950298),
              (0.990798353484797, 0.06680781483981746, 0.0023567291202367816, 0.05290669201262885),
              (0.555769702420364, 0.0010874342925602427, 0.01384695730165569, 0.020431146847619895)]
    for x, a, b, L in cases:
        lo, up = noncentral_pair(d(x), d(a), d(b), d(L))
        rows.append([repr(x), repr(a), repr(b), repr(L), lo, up])
    return rows


def binomial_rows(rng):
    rows = []
    for _ in range(160):
        n = rng.choice([1, 2, 5, 10, 37, 100, 1000, 10 ** 4, 10 ** 5, 10 ** 6, 10 ** 7, 90000000])
        p = rng.choice([1e-9, 1e-6, 1e-3, 0.01, 0.1, 0.3, 0.5, 0.7, 0.9, 0.999, 1 - 1e-7])
        mean, sd = n * p, (n * p * (1 - p)) ** 0.5
        r = rng.random()
        if r < 0.6:
            k = int(mean + rng.gauss(0, 1) * 6 * sd)
        elif r < 0.8:
            k = rng.randint(0, n)
        else:
            k = rng.choice([0, n, n - 1, max(0, int(mean) - 1)])
        k = min(max(k, 0), n)
        lo, up, mass = binomial_pair(k, n, d(p))
        rows.append([str(k), str(n), repr(p), lo, up, mass])
    return rows


def f_rows(rng):
    rows = []
    for _ in range(90):
        df1 = rng.choice([0.1, 1.0, 2.0, 5.0, 12.0, 60.0, 1e3, 1e5, 1e8])
        df2 = rng.choice([0.1, 1.0, 3.0, 10.0, 40.0, 1e3, 1e5, 1e8])
        L = rng.choice([0.0, 0.0, 0.0, 1.0, 10.0, 200.0, 5000.0])
        centre = (df1 + L) / df1 * df2 / max(df2 - 2, 1.0)
        x = float(centre * 10 ** rng.gauss(0, 0.6))
        if rng.random() < 0.25:
            x = 10 ** rng.uniform(-20, 8)
        y, c, d2 = f_arguments(d(x), df1, df2)
        if L == 0:
            lo, up = beta_pair(y, c, d2)
        else:
            lo, up = noncentral_pair(y, c, d2, d(L) / 2)
        rows.append([repr(x), repr(df1), repr(df2), repr(L), lo, up])
    return rows


def solve_small(target, a, b, start):
    """x <= 1/2 with I_x(a,b) = target, by Newton's method on ln I against
    ln x (exact for the power law of the far tail)."""
    x = mpf(start)
    for _ in range(300):
        lo = beta_pair(x, a, b)[0]
        dens = beta_density(x, a, b)
        step = (mpmath.log(target) - mpmath.log(lo)) * lo / (dens * x)
        step = max(min(step, mpf(1)), mpf(-30))
        xn = x * mpmath.exp(step)
        if xn > mpf(0.75):
            xn = (x + mpf(0.75)) / 2
        if abs(xn - x) <= mpf(10) ** (-35) * x:
            return xn
        x = xn
    raise RuntimeError("no convergence at %s %s %s" % (target, a, b))


def start_value(target, a, b):
    import scipy.special as sc
    s = float(sc.betaincinv(float(a), float(b), float(target)))
    if 0 < s <= 0.5:
        return s
    # the power law of the lower tail
    return min(mpmath.exp((mpmath.log(target) + mpmath.log(a) + log_beta(a, b)) / a), mpf(0.5))


def quantile_pair(target, a, b):
    """(x, 1 - x) with I_x(a,b) = target, each with full relative accuracy."""
    if beta_pair(mpf(0.5), a, b)[0] >= target:
        x = solve_small(target, a, b, start_value(target, a, b))
        return x, 1 - x
    t = 1 - target
    y = solve_small(t, b, a, start_value(t, b, a))
    return 1 - y, y


def beta_quant_rows(rng):
    rows = []
    cases = []
    shapes = [1e-3, 0.05, 0.3, 0.7, 1.0, 1.8, 4.0, 15.0, 80.0, 600.0, 5e4, 1e6]
    for _ in range(110):
        a, b = rng.choice(shapes), rng.choice(shapes)
        p = rng.choice([1e-12, 1e-8, 1e-4, 0.01, 0.1, 0.3, 0.5])
        cases.append((a, b, p))
    # Cases aimed at every region of the starting-value table.
    cases += [(0.5, 3.0, 0.1), (1e-3, 2.0, 0.1), (3.0, 0.5, 0.3), (3.0, 0.5, 0.01), (3.0, 1e-3, 0.5),
              (0.2, 0.6, 0.3), (0.2, 0.6, 1e-12), (0.6, 0.2, 0.05), (0.6, 0.2, 0.4), (0.6, 0.3, 1e-6),
              (0.9, 0.3, 0.45), (0.05, 0.02, 0.3), (3e4, 9e4, 0.01), (9e4, 3e4, 0.2), (20.0, 40.0, 0.2),
              (40.0, 12.0, 0.01), (40.0, 12.0, 0.5), (2.0, 3.0, 0.4), (5.0, 2.0, 0.2), (5.0, 2.0, 0.45),
              (0.7, 0.01, 0.01), (0.01, 0.001, 1e-6), (0.1, 0.001, 0.5), (100.0, 40.0, 1e-12),
              (0.01, 0.001, 0.1), (0.1, 0.01, 0.1), (0.05, 0.001, 1e-6), (0.3, 0.05, 0.1),
              (0.001, 0.001, 1e-6), (0.05, 0.05, 0.45), (1.5e5, 5e4, 0.3)]
    for a, b, p in cases:
        pm = d(p)
        for form in ("lower", "upper"):
            # lower: P(X <= q) = p; upper: P(X > q) = p, that is I_q(a,b) = 1 - p
            x, w = quantile_pair(pm if form == "lower" else 1 - pm, d(a), d(b))
            slope = beta_density(x, d(a), d(b)) / pm
            rows.append([form, repr(p), repr(a), repr(b), x, w, slope])
    return rows


def f_quant_rows(rng):
    rows = []
    for _ in range(40):
        df1 = rng.choice([0.01, 0.5, 1.0, 3.0, 10.0, 50.0, 400.0, 1e5])
        df2 = rng.choice([0.01, 0.5, 1.0, 4.0, 25.0, 300.0, 1e5])
        p = rng.choice([1e-12, 1e-6, 1e-3, 0.05, 0.25, 0.5])
        pm = d(p)
        c, d2 = mpf(df1) / 2, mpf(df2) / 2
        for form in ("upper", "lower"):
            if form == "upper":
                # d/(d + c q) is the lower p-quantile y of beta(d, c)
                y, w = quantile_pair(pm, d2, c)
                q = d2 * w / (c * y)
            else:
                y, w = quantile_pair(pm, c, d2)
                q = d2 * y / (c * w)
            # slope: the F density at q over p
            fd = mpmath.exp(mpmath.log(c / d2) * c + (c - 1) * mpmath.log(q) -
                            (c + d2) * mpmath.log1p(c * q / d2) - log_beta(c, d2))
            rows.append([form, repr(p), repr(df1), repr(df2), q, fd / pm])
    return rows


def binomial_quant_rows(rng):
    rows = []
    for _ in range(60):
        n = rng.choice([1, 3, 20, 150, 4000, 10 ** 5, 10 ** 7])
        prob = rng.choice([1e-7, 1e-4, 0.02, 0.25, 0.5, 0.8, 0.995])
        p = rng.choice([1e-12, 1e-6, 1e-3, 0.05, 0.2, 0.5])
        pm = d(p)
        for form in ("lower", "upper"):
            # lower: smallest k with P(X <= k) > p, f = (p - P(X < k))/P(X = k)
            # upper: smallest k with P(X > k) <= p, f = (p - P(X > k))/P(X = k)
            lo_k, hi_k = 0, n  # bisection on the monotone tails
            while lo_k < hi_k:
                mid = (lo_k + hi_k) // 2
                lo, up, mass = binomial_pair(mid, n, d(prob))
                if form == "lower":
                    ok = lo > pm  # smallest k with P(X <= k) > p
                else:
                    ok = up <= pm  # smallest k with P(X > k) <= p
                if ok:
                    hi_k = mid
                else:
                    lo_k = mid + 1
            k = lo_k
            lo, up, mass = binomial_pair(k, n, d(prob))
            if form == "lower":
                f = (pm - (lo - mass)) / mass
            else:
                f = (pm - up) / mass
            rows.append([form, repr(p), str(n), repr(prob), str(k), f, mass])
    return rows


def main():
    rng = random.Random(20261123)
    write_rows(os.path.join(DATA, "elv_beta_df.csv"), "x,a,b,lower,upper,density", beta_rows(rng))
    write_rows(os.path.join(DATA, "elv_binomial_df.csv"), "k,n,prob,lower,upper,mass",
               binomial_rows(rng))
    write_rows(os.path.join(DATA, "elv_beta_quant.csv"), "form,p,a,b,x,1-x,slope", beta_quant_rows(rng))
    write_rows(os.path.join(DATA, "elv_binomial_quant.csv"), "form,p,n,prob,k,f,mass",
               binomial_quant_rows(rng))
    write_rows(os.path.join(DATA, "elv_F_quant.csv"), "form,p,df1,df2,q,slope", f_quant_rows(rng))
    write_rows(os.path.join(DATA, "elv_F_df.csv"), "x,df1,df2,L,lower,upper", f_rows(rng))
    write_rows(os.path.join(DATA, "elv_beta_ncdf.csv"), "x,a,b,L,lower,upper", ncdf_rows(rng))


if __name__ == "__main__":
    main()
