#!/usr/bin/env python3
"""Both tails and quantiles of the noncentral t law at df from 1e-300 to
1e-3, and spot rows of the noncentral chi-square and F at such df.

T = (Z + delta)/S with S = sqrt(V/n), V chi-square with n df. The tails are
  P(T <= t) = Phi(-delta) + J,  P(T > t) = Phi(delta) - J,
  J = E[Phi(t S - delta) - Phi(-delta)],
taken as an integral over the density of y = ln S,
  g(y) = C exp(n y - n e^(2y)/2),  C = 2 (n/2)^(n/2) / Gamma(n/2),
which at tiny n is nearly flat (about n) over the hundreds of units of y
that separate the mass of S near 0 from its chi-square body at
sqrt(2/n); mpmath's tanh-sinh rule on unit pieces of y, with extra points
where Phi(t e^y - delta) turns, resolves it. Below t e^y = 1e-25 the
bracket is phi(delta) t e^y (to 1e-25 of itself) and the piece is summed in
closed form. The
differences of Phi are formed from the smaller tails, so no digits go in
the subtraction. Working precision 30 digits.

Checks (assertions): at delta = 0 the tails equal the central t's beta
expression (1/2) I_{n/(n+t^2)}(n/2, 1/2); at n = 1e-300 they equal the
n -> 0 limits Phi(-delta), Phi(delta) to 1e-290; lower + upper = 1; at a
few points they equal the integral over the normal law of the chi-square
tails, P(T <= t) = int_0^inf phi(v + delta) P(n/2, n v^2/(2 t^2)) dv for
t < 0 (and Phi(-delta) plus the same with phi(v - delta) and Q for t > 0).

Each quantile solves P(T <= q) = p in w = ln|q| on the side of 0 given by
the sign of p - Phi(-delta) (Illinois method after a bisection to unit
width in w); nan where it lies beyond the largest double.

The condition column is |d ln F / d ln t| = |t| f(t)/F (the density f by
the same quadrature at 20 digits) for tails and |d ln q / d ln p| = p/(q f(q)) for quantiles:
the relative change a rounding of the input causes.

Writes tests/data/noncentral_tiny_df.csv:
  family,function,x,df,df2,noncentrality,expected,condition
(function lower, upper or inv; for inv x is p; df2 only for f).
Run: /usr/bin/python3 tools/reference/gen_noncentral_tiny_df.py
"""
import multiprocessing
import os
import sys

import mpmath
from mpmath import mp, mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import d, write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")
DFS = [1e-300, 1e-100, 1e-50, 1e-20, 1e-10, 1e-6, 1e-3]
DELTAS = [-5.0, -1.0, 0.5, 1.0, 10.0]
XS = [-1e10, -2.0, -1e-5, 1e-5, 2.0, 1e10, 1e100]
PS = [1e-10, 0.3, 0.9]
DBL_MAX = mpf(1.7976931348623157e308)


def upper_normal(x):
    if abs(x) > 1e6:  # mpmath's erfc overflows its term estimate far out
        return mpf(0) if x > 0 else mpf(1)
    return mpmath.erfc(x / mpmath.sqrt(2)) / 2


def lower_normal(x):
    return upper_normal(-x)


def phi_difference(a, b):
    """Phi(a) - Phi(b) from the smaller tails."""
    if a > 0 and b > 0:
        return upper_normal(b) - upper_normal(a)
    return lower_normal(a) - lower_normal(b)


def log_chi_constant(n):
    return mpmath.log(2) + (n / 2) * mpmath.log(n / 2) - mpmath.loggamma(n / 2)


def pieces(t, n, delta, y0, y_top):
    """Break points in y: unit steps up to 8 past where Phi(t e^y - delta)
    turns (t e^y near delta and near 1) and within 8 of the chi body at
    ln sqrt(2/n), steps of 1/2 in t e^y across delta -+ 12, steps of 16
    between."""
    at = abs(t)
    centres = [mpmath.log(1 / at), mpmath.log(mpmath.sqrt(2 / n))]
    if delta != 0:
        centres.append(mpmath.log(abs(delta) / at))
    points = {y0, y_top}
    # Unit steps left of where t e^y reaches 1, in which the integrand falls
    # like e^y (wider pieces lose digits there), steps of 16 right of it,
    # where it is nearly flat.
    y = y0
    while y < y_top:
        points.add(y)
        y += 1 if y < centres[0] else 16
    for c in centres:
        for k in range(-8, 9):
            v = c + k
            if y0 < v < y_top:
                points.add(v)
    for k in range(-24, 25):
        v = delta + k / mpf(2)
        if v > 0 and y0 < mpmath.log(v / at) < y_top:
            points.add(mpmath.log(v / at))
    # Where |t| e^y is near 1/(|delta| + 1), the scale on which
    # Phi(t e^y - delta) moves when t and delta have opposite signs: steps
    # of ln(2)/2.
    for k in range(-30, 15):
        v = mpmath.log(mpf(2) ** (k / mpf(2)) / (abs(delta) + 1) / at)
        if y0 < v < y_top:
            points.add(v)
    return sorted(points)


def integral_j(t, n, delta):
    """J = E[Phi(t S - delta) - Phi(-delta)] over y = ln S."""
    log_c = log_chi_constant(n)

    def g(y):
        return mpmath.exp(log_c + n * y - n * mpmath.exp(2 * y) / 2)

    at = abs(t)
    y0 = mpmath.log(mpf(10) ** -25 / at)
    y_top = mpmath.log(mpmath.sqrt(400 / n))
    # Closed form below y0: C phi(delta) t int e^((1 + n) y) dy, with
    # e^(-n e^(2y)/2) = 1 there.
    head = mpmath.exp(log_c + (1 + n) * y0) * mpmath.npdf(delta) * t / (1 + n)
    # mpmath's quad stops on an absolute error of about 10^-dps: the
    # integrand is divided by n Phi(-|delta|), within a factor 1e4 of |J| or
    # above it, so that the stop is relative to J.
    scale = n * upper_normal(abs(delta))
    body = mpmath.quad(
        lambda y: g(y) * phi_difference(t * mpmath.exp(y) - delta, -delta) / scale,
        pieces(t, n, delta, y0, y_top))
    return head + body * scale


def density(t, n, delta):
    """The density E[S phi(t S - delta)] at t != 0, over y = ln S."""
    with mp.workdps(20):
        log_c = log_chi_constant(n)
        y0 = mpmath.log(mpf(10) ** -30 / abs(t))
        y_top = mpmath.log(mpmath.sqrt(400 / n))
        scale = n * upper_normal(abs(delta)) / max(1, abs(t))  # as in integral_j
        return scale * mpmath.quad(
            lambda y: mpmath.exp(log_c + (1 + n) * y - n * mpmath.exp(2 * y) / 2) *
            mpmath.npdf(t * mpmath.exp(y) - delta) / scale, pieces(t, n, delta, y0, y_top))


def tails(t, n, delta):
    if t == 0:
        return lower_normal(-delta), upper_normal(-delta)
    j = integral_j(t, n, delta)
    return lower_normal(-delta) + j, upper_normal(-delta) - j


def central_tails(t, n):
    x = n / (n + t * t)
    half = mpmath.betainc(n / 2, mpf(1) / 2, 0, x, regularized=True) / 2
    return (half, 1 - half) if t < 0 else (1 - half, half)


def quantile(p, n, delta):
    """q with P(T <= q) = p, nan beyond the doubles, and its condition."""
    p = d(p)
    at_zero = lower_normal(-delta)
    if p == at_zero:
        return mpf(0), mpf(0)
    side = 1 if p > at_zero else -1

    def excess(w):  # P(T <= side e^w) - p, increasing in side * w
        return tails(side * mpmath.exp(w), n, delta)[0] - p

    lo, hi = mpmath.log(mpf(10) ** -330), mpmath.log(DBL_MAX)
    if side * excess(hi) < 0:
        return None, None
    if side * excess(lo) > 0:
        return mpf(0), mpf(0)
    with mp.workdps(20):  # the bisection only needs the signs
        while hi - lo > 1:
            mid = (lo + hi) / 2
            if side * excess(mid) < 0:
                lo = mid
            else:
                hi = mid
    # Newton's method in w from the middle of the unit bracket.
    w = (lo + hi) / 2
    with mp.workdps(20):
        for _ in range(60):
            q = side * mpmath.exp(w)
            step = excess(w) / (q * density(q, n, delta))
            w = min(max(w - step, lo), hi)
            if abs(step) < mpf(10) ** -12:
                break
    for _ in range(60):
        q = side * mpmath.exp(w)
        step = excess(w) / (q * density(q, n, delta))
        w = min(max(w - step, lo), hi)
        if abs(step) < mpf(10) ** -24:
            break
    else:
        raise RuntimeError("no convergence at %s, %s, %s" % (p, n, delta))
    q = side * mpmath.exp(w)
    return q, abs(p / (q * density(q, n, delta)))


def by_parts_lower(t, n, delta):
    """P(T <= t) as the integral over the normal law of the chi-square tails
    (mpmath's incomplete gamma): a second route for the checks."""
    def g(v):
        return mpmath.gammainc(n / 2, 0, n * v * v / (2 * t * t), regularized=True)

    cuts = [0] + [mpf(2) ** k for k in range(-12, 7)] + [mpmath.inf]
    scale = upper_normal(abs(delta))  # a relative stop for quad, as in integral_j
    if t > 0:
        return lower_normal(-delta) + scale * mpmath.quad(
            lambda v: mpmath.npdf(v - delta) * (1 - g(v)) / scale, cuts)
    return scale * mpmath.quad(lambda v: mpmath.npdf(v + delta) * g(v) / scale, cuts)


def self_checks():
    for t, n, delta in ((-1e10, 1e-3, 10.0), (2.0, 1e-3, 1.0), (-2.0, 1e-6, 0.5),
                        (1e10, 1e-3, 10.0)):
        lo = tails(d(t), d(n), d(delta))[0]
        other = by_parts_lower(d(t), d(n), d(delta))
        assert abs(lo - other) <= mpf(10) ** -22 * lo, (t, n, delta, lo, other)
    for n in (1e-300, 1e-20, 1e-3):
        for t in (-2.0, 1e-5, 1e10):
            lo, up = tails(d(t), d(n), mpf(0))
            clo, cup = central_tails(d(t), d(n))
            assert abs(lo - clo) <= mpf(10) ** -25 * clo, (n, t, lo, clo)
            assert abs(up - cup) <= mpf(10) ** -25 * cup, (n, t, up, cup)
    for delta in DELTAS:
        for t in XS:
            lo, up = tails(d(t), d(1e-300), d(delta))
            assert abs(lo - lower_normal(-d(delta))) <= mpf(10) ** -290, (t, delta)
            assert abs(lo + up - 1) <= mpf(10) ** -25


def t_rows_at(n):
    mp.dps = 30
    out = []
    if True:
        for delta in DELTAS:
            for x in XS:
                lo, up = tails(d(x), d(n), d(delta))
                f = density(d(x), d(n), d(delta))
                for name, v in (("lower", lo), ("upper", up)):
                    kappa = abs(d(x) * f / v)
                    out.append(("t", name, repr(x), repr(n), "0", repr(delta), v,
                                mpmath.nstr(kappa, 3)))
            for p in PS:
                q, kappa = quantile(p, d(n), d(delta))
                out.append(("t", "inv", repr(p), repr(n), "0", repr(delta),
                            "nan" if q is None else q,
                            "0" if kappa is None else mpmath.nstr(kappa, 3)))
        print("t df", n, file=sys.stderr)
    return out


def t_rows():
    # One process per df (the rows of each df are independent).
    with multiprocessing.Pool(2) as pool:
        return [row for rows in pool.map(t_rows_at, DFS) for row in rows]


def ncchisq_tails(x, n, lam):
    """Poisson mixture of central chi-square laws, sum_j e^-L L^j / j!
    P(n/2 + j, x/2), L = lam/2, until the weights left are below 1e-50."""
    half = lam / 2
    lower = upper = mpf(0)
    weight = mpmath.exp(-half)
    left = 1 - weight
    j = 0
    while True:
        lower += weight * mpmath.gammainc(n / 2 + j, 0, x / 2, regularized=True)
        upper += weight * mpmath.gammainc(n / 2 + j, x / 2, mpmath.inf, regularized=True)
        j += 1
        weight *= half / j
        left -= weight
        if j > half and left < mpf(10) ** -50:
            return lower, upper


def ncf_tails(x, m, n, lam):
    """Noncentral F (numerator df m, denominator df n): the Poisson mixture
    of central beta laws I_w(n/2, m/2 + j), w = n/(n + m x) for the upper
    tail. The lower tail, of the order of n, is the mixture of their
    complements, at a precision that carries n beside 1."""
    with mp.workdps(int(-mpmath.log10(n)) + 40 if n < 1 else mp.dps):
        half = lam / 2
        w = n / (n + m * x)
        lower = upper = mpf(0)
        weight = mpmath.exp(-half)
        left = 1 - weight
        j = 0
        while True:
            tail = mpmath.betainc(n / 2, m / 2 + j, 0, w, regularized=True)
            upper += weight * tail
            lower += weight * (1 - tail)
            j += 1
            weight *= half / j
            left -= weight
            if j > half and left < mpf(10) ** -50:
                return +lower, +upper


def spot_rows():
    out = []
    for n in (1e-300, 1e-100, 1e-20, 1e-10):
        for lam in (0.5, 10.0):
            for x in (1e-300, 1e-10, 1.0, 30.0):
                lo, up = ncchisq_tails(d(x), d(n), d(lam))
                out.append(("chisq", "lower", repr(x), repr(n), "0", repr(lam), lo, "0"))
                out.append(("chisq", "upper", repr(x), repr(n), "0", repr(lam), up, "0"))
            # Denominator df tiny (the numerator's are in
            # noncentral_f_small_df.csv), numerator 3.
            for x in (1e-10, 2.0, 1e10):
                lo, up = ncf_tails(d(x), d(3.0), d(n), d(lam))
                out.append(("f", "lower", repr(x), "3.0", repr(n), repr(lam), lo, "0"))
                out.append(("f", "upper", repr(x), "3.0", repr(n), repr(lam), up, "0"))
    return out


def main():
    mp.dps = 30
    self_checks()
    path = os.path.join(DATA, "noncentral_tiny_df.csv")
    write_rows(path, "family,function,x,df,df2,noncentrality,expected,condition",
               t_rows() + spot_rows())
    print("wrote", path)


if __name__ == "__main__":
    main()
