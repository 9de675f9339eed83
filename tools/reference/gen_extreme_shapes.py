#!/usr/bin/env python3
"""Densities (and, where mpmath reaches them, distribution functions) of the
gamma, chi-square, beta, F and t laws at extreme but valid shapes: every
shape, df and scale from 1e-300 to 1e300, at fixed points and at the centre
of the law plus and minus two standard deviations.

Densities are evaluated in logarithms at 400 digits, enough to carry the
cancellation between terms near 1e303 when a shape is 1e300. Tails come
from mpmath's incomplete gamma and beta functions where their series
converge (they refuse shapes near 1e10 and above; working precision 400
digits for the tiny shapes); those rows are left out.

Writes tests/data/extreme_shapes.csv with rows
    family,function,x,param1,param2,expected,condition
where expected is 0 when the true value is below 1e-330 (an underflow to
double) and inf when it is above the double range, and condition is the sum
of |d ln f / d ln v| over x and the shapes v (0 for tails): the relative
change of the density that one rounding of its inputs causes. Near the mode
of a law with shapes of 1e10 it is about 1e5, so no method working from the
double inputs can promise 1e-12 there; beyond 1e16 the double inputs do not
determine the density at all.
Also writes tests/data/noncentral_f_small_df.csv: both tails of the
noncentral F at numerator df from 1e-300 to 0.5 (noncentral_rows).
Run: /usr/bin/python3 tools/reference/gen_extreme_shapes.py
"""
import os
import sys

import mpmath
from mpmath import mp, mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")
SHAPES = [1e-300, 1e-100, 1e-10, 0.5, 3.0, 1e10, 1e100, 1e300]
FIXED = [1e-300, 1e-10, 0.5, 1.0, 2.0, 1e10, 1e300]


def d(x):
    return mpf(float(x))


def clamp(log_value):
    """exp(log_value), as 0 below 1e-330 and inf above the double range."""
    if log_value < -330 * mpmath.log(10):
        return mpf(0)
    if log_value > 709.8:
        return mpmath.inf
    return mpmath.exp(log_value)


def log_beta(a, b):
    return mpmath.loggamma(a) + mpmath.loggamma(b) - mpmath.loggamma(a + b)


def gamma_log_pdf(x, a, scale):
    z = x / scale
    return (a - 1) * mpmath.log(z) - z - mpmath.loggamma(a) - mpmath.log(scale)


def beta_log_pdf(x, a, b):
    return (a - 1) * mpmath.log(x) + (b - 1) * mpmath.log1p(-x) - log_beta(a, b)


def f_log_pdf(x, m, n):
    return (m / 2 * mpmath.log(m / n) + (m / 2 - 1) * mpmath.log(x) -
            (m + n) / 2 * mpmath.log1p(m * x / n) - log_beta(m / 2, n / 2))


def t_log_pdf(x, n):
    return (mpmath.loggamma((n + 1) / 2) - mpmath.loggamma(n / 2) -
            mpmath.log(n * mpmath.pi) / 2 - (n + 1) / 2 * mpmath.log1p(x * x / n))


def condition(log_pdf, *values):
    """Sum over the inputs v of |v d(log_pdf)/dv|, by central differences
    with a relative step of 1e-60 (the working precision is 400 digits)."""
    total = mpf(0)
    for i, v in enumerate(values):
        if v == 0:
            continue
        h = abs(v) * mpf(10) ** -60
        up = list(values)
        down = list(values)
        up[i] += h
        down[i] -= h
        total += abs(v * (log_pdf(*up) - log_pdf(*down)) / (2 * h))
    return total


def around(centre, spread, low=0.0, high=float("inf")):
    """The fixed points and centre -/+ 2 spread, as doubles inside (low, high)."""
    points = set(FIXED)
    for k in (-2, 0, 2):
        v = float(centre + k * spread)
        points.add(v)
    # Denormal points are left out: the armed state reads them as zero.
    return sorted(v for v in points if low < v < high and (v == 0 or abs(v) >= 2.3e-308))


def tails(kind, x, p1, p2):
    """(lower, upper) from mpmath, or None where its series give up."""
    with mp.workdps(400):
        try:
            if kind == "f":  # P(F <= x) = I_y(m/2, n/2), 1 - y = n / (n + m x)
                # The tail whose beta argument is below 1/2 directly, the
                # other as its complement (an argument near 1 would round).
                y, w = p1 * x / (p2 + p1 * x), p2 / (p2 + p1 * x)
                if y <= 0.5:
                    lo = mpmath.betainc(p1 / 2, p2 / 2, 0, y, regularized=True)
                    up = 1 - lo
                else:
                    up = mpmath.betainc(p2 / 2, p1 / 2, 0, w, regularized=True)
                    lo = 1 - up
            elif kind == "t":  # the tail beyond |x| is I_z(n/2, 1/2) / 2, z = n / (n + x^2)
                far = mpmath.betainc(p1 / 2, mpf(1) / 2, 0, p1 / (p1 + x * x), regularized=True) / 2
                lo, up = (far, 1 - far) if x < 0 else (1 - far, far)
            elif kind == "gamma":
                lo = mpmath.gammainc(p1, 0, x, regularized=True)
                up = mpmath.gammainc(p1, x, mpmath.inf, regularized=True)
            elif kind == "beta":
                lo = mpmath.betainc(p1, p2, 0, x, regularized=True)
                up = mpmath.betainc(p1, p2, x, 1, regularized=True)
            else:
                return None
        except (mpmath.libmp.NoConvergence, ValueError, ZeroDivisionError):
            return None
    return lo, up


def rows():
    out = []

    def add(family, x, p1, p2, log_pdf, tail=None, condition=0):
        out.append((family, "pdf", repr(x), repr(p1), repr(p2), clamp(log_pdf),
                    mpmath.nstr(condition, 3)))
        if tail is not None:
            out.append((family, "lower", repr(x), repr(p1), repr(p2), tail[0], "0"))
            out.append((family, "upper", repr(x), repr(p1), repr(p2), tail[1], "0"))

    for a in SHAPES:
        sd = float(mpmath.sqrt(d(a)))
        for x in around(a, sd):
            t = tails("gamma", d(x), d(a), None) if a <= 1e6 else None
            add("gamma", x, a, 1.0, gamma_log_pdf(d(x), d(a), 1), t,
                condition(lambda x_, a_: gamma_log_pdf(x_, a_, 1), d(x), d(a)))
        for scale in (1e-300, 1e300):
            for x in (1e-300, 1.0, 1e300):
                add("gammascale", x, a, scale, gamma_log_pdf(d(x), d(a), d(scale)), None,
                    condition(gamma_log_pdf, d(x), d(a), d(scale)))
        for x in around(2 * a, 2 * sd):
            t = tails("gamma", d(x) / 2, d(a) / 2, None) if a <= 1e6 else None
            add("chisq", x, a, 0.0, gamma_log_pdf(d(x), d(a) / 2, 2), t,
                condition(lambda x_, a_: gamma_log_pdf(x_, a_ / 2, 2), d(x), d(a)))
        for x in around(0.0, 1.0, -float("inf")) + [-1e300, -3.0]:
            t = tails("t", d(x), d(a), None) if a <= 1e6 else None
            add("t", x, a, 0.0, t_log_pdf(d(x), d(a)), t, condition(t_log_pdf, d(x), d(a)))
    for a in SHAPES:
        for b in SHAPES:
            mean = d(a) / (d(a) + d(b))
            sd = mpmath.sqrt(d(a) * d(b) / (d(a) + d(b) + 1)) / (d(a) + d(b))
            for x in around(mean, sd, 0.0, 1.0) + [1 - 2.0 ** -40]:
                if not 0 < x < 1:
                    continue
                t = tails("beta", d(x), d(a), d(b)) if max(a, b) <= 1e6 else None
                add("beta", x, a, b, beta_log_pdf(d(x), d(a), d(b)), t,
                    condition(beta_log_pdf, d(x), d(a), d(b)))
            sd = mpmath.sqrt(2 / d(a) + 2 / d(b))
            for x in around(mpf(1), sd):
                t = tails("f", d(x), d(a), d(b)) if max(a, b) <= 1e6 else None
                add("f", x, a, b, f_log_pdf(d(x), d(a), d(b)), t,
                    condition(f_log_pdf, d(x), d(a), d(b)))
    return out


def noncentral_f(x, m, n, ncp):
    """Both tails of the noncentral F as the Poisson mixture of central beta
    laws, sum_j e^-mu mu^j / j! I_y(m/2 + j, n/2), mu = ncp/2,
    y = m x / (n + m x), summed until the weights left are below 1e-40."""
    with mp.workdps(50):
        mu = ncp / 2
        y = m * x / (n + m * x)
        w = n / (n + m * x)  # 1 - y without cancellation
        lower = upper = mpf(0)
        weight = mpmath.exp(-mu)
        left = 1 - weight
        j = 0
        while True:
            lower += weight * mpmath.betainc(m / 2 + j, n / 2, 0, y, regularized=True)
            if w < 0.5:
                upper += weight * mpmath.betainc(n / 2, m / 2 + j, 0, w, regularized=True)
            else:  # w near 1 would round: the complement of the lower part
                upper += weight * (1 - mpmath.betainc(m / 2 + j, n / 2, 0, y, regularized=True))
            j += 1
            weight *= mu / j
            left -= weight
            if j > mu and left < mpf(10) ** -40:
                return lower, upper


def noncentral_rows():
    """Noncentral F at numerator df down to 1e-300, where the moving shape of
    the noncentral beta mixture, m/2, vanishes beside the index j."""
    out = []
    for m in (1e-300, 1e-100, 1e-16, 1e-12, 1e-10, 1e-6, 0.5):
        for n, ncp in ((7.0, 1.0), (7.0, 10.0), (0.5, 3.0), (1e4, 1.0)):
            for x in (1e-10, 0.5, 2.5, 3.0, 50.0, 1e10):
                lo, up = noncentral_f(d(x), d(m), d(n), d(ncp))
                out.append((repr(x), repr(m), repr(n), repr(ncp), lo, up))
    return out


def main():
    mp.dps = 400
    path = os.path.join(DATA, "extreme_shapes.csv")
    write_rows(path, "family,function,x,param1,param2,expected,condition", rows())
    print("wrote", path)
    path = os.path.join(DATA, "noncentral_f_small_df.csv")
    write_rows(path, "x,df1,df2,noncentrality,lower,upper", noncentral_rows())
    print("wrote", path)


if __name__ == "__main__":
    main()
