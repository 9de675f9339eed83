#!/usr/bin/env python3
"""Reference values for the exported distribution functions at double
precision: densities, both tails and quantiles of the families on the ELV
routines (normal, gamma, chi-square, beta, F, t, central and noncentral, and
the binomial, Poisson and hypergeometric laws), from the body out to the far
tails (tail probabilities down to 1e-300, quantiles of p from 1e-300 to
1 - 1e-15).

Writes tests/data/distribution_precision.csv with rows
    family,function,x,param1,param2,param3,param4,expected
(the layout of kernels.csv; the family builders are those of gen_kernels.py
and gen_kernels_beta_t.py, run here over wider grids). Noncentral t tails
come from the Poisson mixture of incomplete beta ratios at a precision that
grows with the smaller tail (gen_noncentral_t_grid.py), so that far tails keep
their digits.
The noncentral t rows, slow to integrate, go to
tests/data/distribution_precision_nct.csv in a run of their own.
Run: /usr/bin/python3 tools/reference/gen_distribution_precision.py
     /usr/bin/python3 tools/reference/gen_distribution_precision.py noncentral-t
"""
import os
import sys

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
import gen_kernels as gk  # noqa: E402
import gen_kernels_beta_t as gb  # noqa: E402
import gen_elv_t_noncentral as gt  # noqa: E402
import gen_noncentral_t_grid as gn  # noqa: E402
from refdata import d, write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")

def log_ncdf(y):
    """log Phi(y); beyond |y| = 1e50 by the leading asymptotic term, whose
    relative correction 1/y^2 is far below the working precision (mpmath's own
    erfc overflows its bookkeeping for |y| above about 1e150)."""
    if y < -1e50:
        return -y * y / 2 - mpmath.log(-y) - mpmath.log(2 * mpmath.pi) / 2
    if y > 1e50:
        return mpf(0)
    return mpmath.log(mpmath.ncdf(y))


gt.log_phi_lower = log_ncdf
gt.log_phi_upper = lambda y: log_ncdf(-y)

_gammainc = mpmath.gammainc


def gammainc(a, lo, hi, regularized=True):
    """Regularized incomplete gamma; mpmath's own lower form gives up for large
    shapes, so the lower tail is taken from its Kummer series
    P(a,x) = x^a e^-x / Gamma(a+1) 1F1(1; a+1; x), and the upper tail as its
    complement where that loses nothing."""
    assert regularized
    a = mpf(a)
    if lo == 0:
        x = mpf(hi)
        if x > a + 1:
            return 1 - _gammainc(a, x, mpmath.inf, regularized=True)
        return mpmath.exp(a * mpmath.log(x) - x - mpmath.loggamma(a + 1)) * mpmath.hyp1f1(
            1, a + 1, x, maxterms=10**8)
    x = mpf(lo)
    if x > a + 1:
        return _gammainc(a, x, mpmath.inf, regularized=True)
    return 1 - gammainc(a, 0, x)


mpmath.gammainc = gammainc

FAR = [1e-300, 1e-250, 1e-200, 1e-100, 1e-50, 1e-20, 1e-13]
PS = FAR + gk.PS + [1 - 1e-13, 1 - 1e-15]


def solve_real(f):
    """Root of an increasing f on the whole line: secant steps in u, y = sinh(u),
    from a bracket found by doubling steps, safeguarded by bisection."""
    lo, hi = mpf(-1), mpf(1)
    while f(mpmath.sinh(lo)) > 0:
        if lo <= -650:
            return None
        lo = max(2 * lo, mpf(-650))
    while f(mpmath.sinh(hi)) < 0:
        if hi >= 650:
            return None
        hi = min(2 * hi, mpf(650))
    flo, fhi = f(mpmath.sinh(lo)), f(mpmath.sinh(hi))
    for _ in range(200):
        mid = lo - flo * (hi - lo) / (fhi - flo) if mpmath.isfinite(flo) and mpmath.isfinite(fhi) \
            else (lo + hi) / 2
        if not lo < mid < hi or _ % 4 == 3:
            mid = (lo + hi) / 2
        fm = f(mpmath.sinh(mid))
        if fm == 0:
            return mpmath.sinh(mid)
        if fm < 0:
            lo, flo = mid, fm
        else:
            hi, fhi = mid, fm
        if hi - lo <= mpf(10) ** -30 * max(1, abs(lo)):
            break
    return mpmath.sinh((lo + hi) / 2)


def smaller_tail_root(low, up):
    """Quantile from the smaller tail, solved in logarithms."""
    def safe_log(v):
        return mpmath.log(v) if v > 0 else -mpmath.inf

    def inv(p):
        if p < mpf(1) / 2:
            return solve_real(lambda y: safe_log(low(y)) - mpmath.log(p))
        return solve_real(lambda y: mpmath.log(1 - p) - safe_log(up(y)))
    return inv


def student(df, delta, xs, ps):
    k, dl = d(df), d(delta)
    mpmath.mp.dps = 40
    if delta == 0:
        low = lambda x: gb.t_tails(x, k)[0]  # noqa: E731
        up = lambda x: gb.t_tails(x, k)[1]  # noqa: E731
        pdf = lambda x: mpmath.exp(mpmath.loggamma((k + 1) / 2) - mpmath.loggamma(k / 2)  # noqa
                                   - mpmath.log(mpmath.pi * k) / 2
                                   - (k + 1) / 2 * mpmath.log1p(x * x / k))
    else:
        # Both tails from the Poisson mixture at growing precision
        # (gen_noncentral_t_grid.py): the integral over the chi variable
        # misses the peak of its integrand once it lies below 1e-5 in that
        # variable, as for the upper tail at t = 8e15 with df = 1.
        low = lambda x: gn.tails_mixture(x, k, dl, 60)[0]  # noqa: E731
        up = lambda x: gn.tails_mixture(x, k, dl, 60)[1]  # noqa: E731
        pdf = None
    inv = smaller_tail_root(low, up)
    rows = gk.rows_for("t", [df, delta], xs, [p for p in ps if not (delta == 0 and p == 0.5)],
                       pdf, low, up, inv)
    mpmath.mp.dps = 60
    return rows


def fisher(d1, d2, xs, ps):
    a, b = d(d1) / 2, d(d2) / 2

    def low(x):
        y = d(d1) * x / (d(d1) * x + d(d2))
        return gb.I(y, a, b)

    def up(x):
        y = d(d2) / (d(d1) * x + d(d2))
        return gb.I(y, b, a)
    pdf = lambda x: mpmath.exp(mpmath.loggamma(a + b) - mpmath.loggamma(a)  # noqa: E731
                               - mpmath.loggamma(b) + a * mpmath.log(d(d1) / d(d2))
                               + (a - 1) * mpmath.log(x) - (a + b) * mpmath.log1p(x * d(d1) / d(d2)))
    inv0 = smaller_tail_root(lambda y: low(mpmath.exp(y)), lambda y: up(mpmath.exp(y)))
    def inv(p):
        y = inv0(p)
        return None if y is None else mpmath.exp(y)
    return gk.rows_for("f", [d1, d2, 0.0], xs, ps, pdf, low, up, inv)


def noncentral_chisq_inv(df, nc, ps):
    k, L = d(df), d(nc)
    rows = []
    for p in ps:
        P = d(p)
        if P < mpf(1) / 2:
            q = gk.solve_increasing(lambda y: mpmath.log(gk.ncchi2(y, k, L, False)) - mpmath.log(P),
                                    mpf(10) ** -300, 100 * (df + nc) + 1000, logscale=True)
        else:
            q = gk.solve_increasing(lambda y: mpmath.log(1 - P) - mpmath.log(gk.ncchi2(y, k, L, True)),
                                    mpf(10) ** -300, 100 * (df + nc) + 1000, logscale=True)
        rows.append(["chisq", "inv", float(p), df, nc, 0.0, 0.0, q])
    return rows


CACHE = os.environ.get("QEL_REFERENCE_CACHE")


def block(name, make):
    """Rows of one block; with QEL_REFERENCE_CACHE set, finished blocks are
    kept there between runs (a long run can be resumed)."""
    import pickle
    path = os.path.join(CACHE, name + ".pickle") if CACHE else None
    if path and os.path.exists(path):
        with open(path, "rb") as f:
            return pickle.load(f)
    rows = make()
    if path:
        with open(path, "wb") as f:
            pickle.dump(rows, f)
    print(name, file=sys.stderr, flush=True)
    return rows


def main():
    gk.PS = PS
    gb.PS = PS
    header = "family,function,x,param1,param2,param3,param4,expected"
    rows = []
    if "noncentral-t" in sys.argv[1:]:
        # The integral resolves the peak of its integrand down to about 1e-23
        # in the chi variable, so the far lower quantiles of df 1 and 10
        # (|t| of 1e275 and 1e28 at p = 1e-300) are left out.
        for df, delta, xs, ps in ((1.0, 10.0, [-3.0, 2.0, 9.0, 50.0, 1e6], [1e-20, 1e-6]),
                                  (10.0, 2.0, [-8.0, -1.0, 0.5, 2.0, 6.0, 40.0], [1e-20, 1e-6]),
                                  (30.0, -3.0, [-40.0, -6.0, -3.0, -1.0, 0.5, 4.0],
                                   [1e-300, 1e-20, 1e-6])):
            rows += student(df, delta, xs, ps + [0.5, 0.99, 1 - 1e-15])
            print("noncentral t", df, file=sys.stderr, flush=True)
        write_rows(os.path.join(DATA, "distribution_precision_nct.csv"), header, rows)
        return
    rows += block("normal", lambda: gk.normal(0.0, 1.0) + gk.normal(3.0, 2.0))
    for shape in (0.05, 0.5, 1.0, 2.5, 30.0, 1e4):
        rows += block("gamma%g" % shape, lambda: gk.gamma_family(shape, 1.0, 0.0))
    for df in (1.0, 7.0, 2000.0):
        rows += block("chisq%g" % df, lambda: gk.chisq(df, 0.0))
    for df, nc in ((3.0, 10.0), (50.0, 200.0), (2000.0, 10.0)):
        rows += block("ncchisq%g" % df, lambda: gk.chisq(df, nc) + noncentral_chisq_inv(
            df, nc, [1e-300, 1e-20, 1e-3, 0.5, 1 - 1e-13]))
    for a, b in ((0.5, 0.5), (2.0, 7.5), (100.0, 3000.0), (0.05, 4.0)):
        rows += block("beta%g" % a, lambda: gb.beta(a, b))
    for d1, d2 in ((2.0, 3.0), (10.0, 50.0)):
        rows += block("f%g" % d1, lambda: fisher(
            d1, d2, [1e-30, 1e-4, 0.05, 0.5, 1.0, 2.2, 8.0, 60.0, 1e8], PS))
    rows += block("ncf", lambda: gb.fdist(4.0, 12.0, 5.0))
    central = [-1e30, -1e4, -40.0, -6.0, -1.5, -1e-6, 0.0, 0.4, 2.5, 9.0, 300.0, 1e20]
    for df in (1.0, 5.5, 60.0, 3000.0):
        rows += block("t%g" % df, lambda: student(df, 0.0, central, PS))
    for n, p in ((10, 0.5), (100, 0.73), (5000, 0.4), (100000, 1e-3)):
        rows += block("binomial%d" % n, lambda: gk.binomial(n, p)[0])
    for mean in (0.5, 40.0, 1e5):
        rows += block("poisson%g" % mean, lambda: gk.poisson(mean))
    for N, M, n in ((50, 25, 30), (1000, 400, 150), (10000, 4000, 500)):
        rows += block("hyper%d" % N, lambda: gk.hypergeometric(N, M, n))
    write_rows(os.path.join(DATA, "distribution_precision.csv"), header, rows)


if __name__ == "__main__":
    main()
