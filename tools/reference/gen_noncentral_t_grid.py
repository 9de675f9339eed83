#!/usr/bin/env python3
"""Reference tails of the noncentral t over the body and the far tails, for
the exported TCdf and TInvCdf.

Two independent evaluations in mpmath:
  - the Poisson mixture of incomplete beta ratios (Lenth, AS 243) at 50 to
    330 digits, so that the difference of nearly equal sums for t < 0 < delta
    keeps its digits: with x = t^2/(n + t^2), b = n/2, L = delta^2/2,
      P(T > |t|; d) = (1/2) sum_j [W(j) C(j + 1/2) +- W(j + 1/2) C(j + 1)],
    W(u) = e^-L L^u / Gamma(u + 1), C(a) = 1 - I_x(a, b), sign + for d >= 0;
  - the integral over the chi variable of gen_elv_t_noncentral.py (tail),
    as a cross-check of the far tails: rows where the two disagree by more
    than 1e-18 relative are refused. (That integral misses the peak of its
    integrand once it lies below 1e-5 in the chi variable, as for the upper
    tail at t = 8e15 with df = 1, so the quantiles come from the mixture.)
Writes tests/data/noncentral_t_grid.csv with rows
    function,x,df,delta,expected
(function lower, upper or inv; inv rows give the quantile of probability x).
Run: /usr/bin/python3 tools/reference/gen_noncentral_t_grid.py
"""
import os
import sys

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
import gen_elv_t_noncentral as gt  # noqa: E402
from refdata import d, fmt  # noqa: E402

OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data",
                   "noncentral_t_grid.csv")


def upper_positive(t, n, delta):
    """P(T > t) for t >= 0 by the mixture (positive terms when delta >= 0,
    alternating sums otherwise)."""
    x = t * t / (n + t * t)
    b = n / 2
    L = delta * delta / 2
    sign = 1 if delta >= 0 else -1
    total = mpf(0)
    j = 0
    while True:
        w0 = mpmath.exp(-L + j * mpmath.log(L) - mpmath.loggamma(j + 1)) if L > 0 else mpf(j == 0)
        w1 = mpmath.exp(-L + (j + mpf(1) / 2) * mpmath.log(L) - mpmath.loggamma(j + mpf(3) / 2)) \
            if L > 0 else mpf(0)
        c0 = mpmath.betainc(j + mpf(1) / 2, b, x, 1, regularized=True)
        c1 = mpmath.betainc(j + 1, b, x, 1, regularized=True)
        term = w0 * c0 + sign * w1 * c1
        total += term
        if j > L + 10 and (w0 + w1) < mpf(10) ** (-mpmath.mp.dps + 5) * abs(total):
            break
        j += 1
    return total / 2


def tails_mixture(t, n, delta, digits):
    """Both tails; the digits grow with the smaller tail, which the
    alternating sums reach by cancellation."""
    low, up = tails_mixture_at(t, n, delta, digits)
    small = min(low, up)
    lost = int(-mpmath.log10(small)) if small > 0 else 300
    if lost > digits - 30:
        low, up = tails_mixture_at(t, n, delta, lost + 40)
    return low, up


def tails_mixture_at(t, n, delta, digits):
    with mpmath.workdps(digits):
        t, n, delta = mpf(t), mpf(n), mpf(delta)
        if t >= 0:
            up = upper_positive(t, n, delta)
            return 1 - up, up
        low = upper_positive(-t, n, -delta)
        return low, 1 - low


def tails_integral(t, n, delta):
    with mpmath.workdps(40):
        return gt.tail(d(t), d(n), d(delta), False), gt.tail(d(t), d(n), d(delta), True)


def quantile(p, n, delta):
    """x with P(T <= x) = p, solved on the smaller tail (by the mixture) in
    logarithms."""
    start = QUANTILE_STARTS[(p, n, delta)]
    p = d(p)
    upper = p > mpf(1) / 2
    target = mpmath.log(1 - p if upper else p)

    def f(x):
        v = tails_mixture(x, n, delta, 60)[1 if upper else 0]
        return mpmath.log(v) - target
    with mpmath.workdps(40):
        return mpmath.findroot(f, mpf(start), tol=mpf(10) ** -30)


BODY_DF = (0.5, 1.0, 2.5, 5.0, 10.0, 30.0, 200.0, 5000.0)
BODY_DELTA = (0.3, 2.0, 5.0, -3.0)
BODY_T = (-8.0, -2.0, -0.7, -0.1, 0.3, 1.5, 4.0, 20.0)
# Far tails: (t, df, delta), both tails where the value is a normal double.
FAR = ((1e8, 5.0, 1e-20), (-1e8, 5.0, -1e-20), (-50.0, 10.0, 3.0), (-1e3, 3.0, 1.0),
       (-4.0, 30.0, 6.0), (-20.0, 2.0, 8.0), (60.0, 10.0, -2.0), (1e5, 1.0, 2.0),
       (0.2, 10.0, 15.0), (300.0, 20.0, 1.0))
# Far tails whose integrand peaks below 1e-5 in the chi variable, where only
# the mixture serves.
MIXTURE_ONLY = ((-1e20, 0.5, 3.0), (-1e10, 2.5, 1.0), (3e7, 1.0, -4.0))
# Quantiles near 1 and 0, with starting points for the root search.
QUANTILE_STARTS = {(1 - 1e-15, 1.0, 10.0): 7.98e15, (1 - 1e-15, 10.0, 2.0): 141.4,
                   (1e-15, 10.0, 2.0): -30.0, (1e-10, 5.0, 1.0): -70.0}


def main():
    rows = []
    for n in BODY_DF:
        for delta in BODY_DELTA:
            for t in BODY_T:
                low, up = tails_mixture(t, n, delta, 60)
                rows.append(("lower", t, n, delta, low))
                rows.append(("upper", t, n, delta, up))
        print("df", n, file=sys.stderr, flush=True)
    for t, n, delta in FAR:
        low, up = tails_integral(t, n, delta)
        ref_low, ref_up = tails_mixture(t, n, delta, 340)
        for name, a, b in (("lower", low, ref_low), ("upper", up, ref_up)):
            if b > mpf(10) ** -280:
                assert abs(a - b) <= mpf(10) ** -18 * b, (t, n, delta, name, a, b)
                rows.append((name, t, n, delta, b))
    for t, n, delta in MIXTURE_ONLY:
        low, up = tails_mixture(t, n, delta, 60)
        for name, b in (("lower", low), ("upper", up)):
            if b > mpf(10) ** -280:
                rows.append((name, t, n, delta, b))
    for (p, n, delta) in QUANTILE_STARTS:
        rows.append(("inv", p, n, delta, quantile(p, n, delta)))
    with open(OUT, "w") as out:
        out.write("# function,x,df,delta,expected\n")
        out.write("# generated by tools/reference/gen_noncentral_t_grid.py with mpmath "
                  + mpmath.__version__ + "\n")
        for r in rows:
            out.write(",".join([r[0], repr(r[1]), repr(r[2]), repr(r[3]), fmt(r[4])]) + "\n")


if __name__ == "__main__":
    main()
