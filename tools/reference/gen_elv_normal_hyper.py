"""Reference data for the ELV normal, central t and hypergeometric routines.

Writes tests/data/elv_normal.csv, elv_normal_quantiles.csv, elv_normal_far_tail.csv, elv_t_central.csv,
elv_t_quantiles.csv, elv_hypergeo.csv and elv_hypergeo_quantiles.csv.
Run with /usr/bin/python3 (mpmath) from the repository root.
"""
import math
import os

import mpmath
from mpmath import mp, mpf

from refdata import d, write_rows

mp.dps = 60
OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")


def normal_tails(x):
    x = d(x)
    upper = mpmath.erfc(x / mpmath.sqrt(2)) / 2
    lower = mpmath.erfc(-x / mpmath.sqrt(2)) / 2
    return lower, upper


def normal_upper_quantile(p):
    """Positive z with P(Z > z) = p, by Newton's method on log Q."""
    p = d(p)
    z = mpmath.sqrt(-2 * mpmath.log(p)) if p < mpf("0.3") else mpf(0)
    for _ in range(200):
        q = mpmath.erfc(z / mpmath.sqrt(2)) / 2
        dens = mpmath.npdf(z)
        step = (q - p) / dens
        z += step
        if abs(step) < mpf(10) ** (-45) * (1 + abs(z)):
            break
    return z


def gen_normal():
    xs = [0.0, 1e-300, 1e-20, 1e-14, 1e-8, 0.001, 0.1, 0.5, 1.0, 1.5, 2.0, 3.0, 5.0,
          7.5, 10.0, 15.0, 20.0, 25.0, 30.0, 35.0, 37.0, 37.5, 38.0, 38.5, 40.0]
    rows = []
    for x in xs:
        for v in ([x, -x] if x != 0 else [x]):
            lo, up = normal_tails(v)
            rows.append([repr(v), lo, up])
    write_rows(os.path.join(OUT, "elv_normal.csv"), "x,lower,upper", rows)

    ps = [0.5, 0.49999999, 0.4999975, 0.49, 0.4, 0.3, 0.25000001, 0.25, 0.2, 0.1, 0.05,
          0.025, 0.01, 1e-3, 1e-4, 1e-6, 1e-8, 1e-10, 1e-12, 1e-15, 1e-20, 1e-30, 1e-40,
          1e-50, 1e-60, 1e-70, 1e-80, 1e-90, 1e-99, 1e-100, 3.7e-17, 2.2e-75]
    rows = []
    for p in ps:
        rows.append([repr(p), normal_upper_quantile(p)])
    write_rows(os.path.join(OUT, "elv_normal_quantiles.csv"), "p,z (P(Z > z) = p)", rows)


def gen_normal_far_tail():
    """P(Z > x) rounded to the nearest double, for x in [8, 38.4]; points whose
    truth lies within 0.02 ulp of a tie between two doubles are left out."""
    rows = []
    for i in range(59):
        x = 8.0 + i * 0.5049
        t = normal_tails(x)[1]
        v = float(t)
        below, above = math.nextafter(v, 0.0), math.nextafter(v, 1.0)
        side = above if t > mpf(v) else below
        if abs(t - mpf(v)) > mpf("0.48") * abs(mpf(side) - mpf(v)):
            continue
        rows.append([repr(x), repr(v)])
    write_rows(os.path.join(OUT, "elv_normal_far_tail.csv"), "x,P(Z > x) to the nearest double",
               rows)


def t_two_sided_by_quadrature(t, df):
    """P(|T| > |t|) by integrating the density over log |x|."""
    logc = (mpmath.loggamma((df + 1) / 2) - mpmath.loggamma(df / 2)
            - mpmath.log(df * mpmath.pi) / 2)

    def f(u):
        x = mpmath.exp(u)
        return mpmath.exp(logc - (df + 1) / 2 * mpmath.log1p(x * x / df) + u)

    a = abs(t)
    if a < 1:
        inner = mpmath.quad(lambda x: mpmath.exp(logc - (df + 1) / 2 * mpmath.log1p(x * x / df)),
                            [0, a])
        return 1 - 2 * inner
    u0 = mpmath.log(a)
    pts = [u0 + s for s in (0, mpf(1) / 8, mpf(1) / 2, 1, 2, 4, 8, 16, 32, 64, 128, 256)]
    return 2 * mpmath.quad(f, pts + [mpmath.inf])


def t_two_sided(t, df):
    x = df / (df + t * t)
    try:
        return mpmath.betainc(df / 2, mpf(1) / 2, 0, x, regularized=True)
    except (mpmath.libmp.NoConvergence, ValueError):
        return t_two_sided_by_quadrature(t, df)


def t_lower_upper(t, df):
    t, df = d(t), d(df)
    # P(|T| > |t|) = I_x(df/2, 1/2), x = df/(df + t^2)
    both = t_two_sided(t, df)
    h = both / 2  # 60 digits: the complement keeps full double accuracy
    if t < 0:
        return h, 1 - h
    return 1 - h, h


def gen_t_central():
    dfs = [0.002, 0.01, 0.1, 0.5, 1.0, 1.5, 2.0, 3.0, 5.0, 10.0, 30.0, 100.0, 1000.0,
           1e5, 1e7, 189812530.0, 1.9e8]
    ts = [0.0, 1e-10, 0.001, 0.5, 1.0, 2.0, 5.0, 10.0, 40.0, 1e3, 1e10, 1e100, 1e150]
    rows = []
    for df in dfs:
        for t in ts:
            for v in ([t, -t] if t != 0 else [t]):
                lo, up = t_lower_upper(v, df)
                rows.append([repr(v), repr(df), lo, up])
    write_rows(os.path.join(OUT, "elv_t_central.csv"), "t,df,lower,upper", rows)

    rows = []
    for df in [0.002, 0.05, 0.5, 1.0, 2.5, 4.0, 10.0, 50.0, 1000.0, 1e6, 189812530.0, 1.9e8]:
        for p in [0.5, 0.4, 0.25, 0.1, 1e-3, 1e-6, 1e-9, 1e-12]:
            pp = d(p)
            if pp == mpf("0.5"):
                rows.append([repr(p), repr(df), mpf(0)])
                continue
            # bisection on log t for P(T > t) = p
            # quantiles beyond 1e300 are not representable: skipped
            lo, hi = mpf(-60), mpf(690)
            if t_two_sided(mpmath.exp(hi), d(df)) / 2 > pp:
                continue
            for _ in range(400):
                mid = (lo + hi) / 2
                tv = mpmath.exp(mid)
                tail = t_two_sided(tv, d(df)) / 2
                if tail > pp:
                    lo = mid
                else:
                    hi = mid
                if hi - lo < mpf(10) ** -30:
                    break
            rows.append([repr(p), repr(df), mpmath.exp((lo + hi) / 2)])
    write_rows(os.path.join(OUT, "elv_t_quantiles.csv"), "p,df,t (P(T > t) = p)", rows)


def logmass(k, N, M, n):
    return (mpmath.loggamma(M + 1) - mpmath.loggamma(k + 1) - mpmath.loggamma(M - k + 1)
            + mpmath.loggamma(N - M + 1) - mpmath.loggamma(n - k + 1)
            - mpmath.loggamma(N - M - n + k + 1) - mpmath.loggamma(N + 1)
            + mpmath.loggamma(n + 1) + mpmath.loggamma(N - n + 1))


def hyper_tails(k, N, M, n):
    """mass, P(X <= k), P(X > k), each summed away from k as far as it matters."""
    lo_k = max(0, n - (N - M))
    hi_k = min(n, M)
    mass = mpmath.exp(logmass(k, N, M, n))
    mode = (n + 1) * (M + 1) // (N + 2)

    def tail(j0, direction):
        s = mpf(0)
        j = j0
        term = mpmath.exp(logmass(j, N, M, n)) if lo_k <= j <= hi_k else mpf(0)
        while lo_k <= j <= hi_k:
            s += term
            if direction > 0:
                if j + 1 > hi_k:
                    break
                term *= mpf(M - j) * (n - j) / ((j + 1) * mpf(N - M - n + j + 1))
            else:
                if j - 1 < lo_k:
                    break
                term *= mpf(j) * (N - M - n + j) / (mpf(M - j + 1) * (n - j + 1))
            j += direction
            if term < s * mpf(10) ** -40 and ((direction > 0 and j > mode) or (direction < 0 and j < mode)):
                break
        return s

    if k >= mode:
        upper = tail(k + 1, 1)
        lower = 1 - upper
    else:
        lower = tail(k, -1)
        upper = 1 - lower
    return mass, lower, upper


HYPER_CASES = [
    # N, M, n, list of k
    (2, 1, 1, [0, 1]),
    (10, 3, 4, [0, 1, 2, 3]),
    (20, 10, 10, [0, 3, 5, 7, 10]),
    (50, 40, 10, [0, 2, 5, 8, 9, 10]),
    (50, 10, 40, [0, 2, 5, 8, 9, 10]),
    (50, 40, 45, [35, 36, 38, 40]),
    (1000, 30, 200, [0, 1, 6, 15, 29, 30]),
    (1000, 600, 700, [300, 400, 420, 450, 500, 600]),
    (100000, 5000, 2000, [0, 20, 100, 180, 400, 2000]),
    (10000000, 5000000, 5000000, [2480000, 2495000, 2500000, 2505000, 2520000]),
    (90000000, 45000000, 45000000, [22480000, 22495000, 22500000, 22510000, 22530000]),
    (90000000, 30, 50000000, [0, 5, 16, 25, 30]),
    (90000000, 70000000, 20000000, [15540000, 15550000, 15560000, 15570000]),
    (94906265, 1000, 94906000, [735, 990, 999, 1000]),
]


def gen_hyper():
    rows = []
    for N, M, n, ks in HYPER_CASES:
        for k in ks:
            mass, lo, up = hyper_tails(k, N, M, n)
            rows.append([str(k), str(N), str(M), str(n), lo, up, mass])
    write_rows(os.path.join(OUT, "elv_hypergeo.csv"), "k,N,M,n,lower,upper,mass", rows)

    rows = []
    qcases = [(20, 10, 10), (50, 40, 10), (50, 10, 40), (50, 40, 45), (1000, 30, 200),
              (1000, 600, 700), (100000, 5000, 2000), (10000000, 5000000, 5000000),
              (90000000, 30, 50000000), (90000000, 1000, 50)]
    for N, M, n in qcases:
        lo_k = max(0, n - (N - M))
        hi_k = min(n, M)
        for p in [0.5, 0.3, 0.05, 1e-3, 1e-6, 1e-12]:
            pp = d(p)
            # lower: smallest k with P(X <= k) > p; f = (p - P(X < k))/P(X = k)
            # upper: largest k with P(X >= k) > p; f = (p - P(X > k))/P(X = k)
            mean = mpf(n) * M / N
            sd = mpmath.sqrt(mean * (N - M) / N * (N - n) / (N - 1))
            a = max(lo_k, int(mean - 12 * sd) - 12)
            b = min(hi_k, int(mean + 12 * sd) + 12)
            if b - a > 400000:
                continue
            masses = {}
            _, cdf_a, _ = hyper_tails(a, N, M, n)
            cdf = cdf_a - mpmath.exp(logmass(a, N, M, n))
            klow = None
            j = a
            term = mpmath.exp(logmass(a, N, M, n))
            while j <= b:
                if cdf + term > pp:
                    klow = (j, (pp - cdf) / term)
                    break
                cdf += term
                term *= mpf(M - j) * (n - j) / ((j + 1) * mpf(N - M - n + j + 1))
                j += 1
            _, _, up_b = hyper_tails(b, N, M, n)
            surv = up_b
            j = b
            term = mpmath.exp(logmass(b, N, M, n))
            kup = None
            while j >= a:
                if surv + term > pp:
                    kup = (j, (pp - surv) / term)
                    break
                surv += term
                term *= mpf(j) * (N - M - n + j) / (mpf(M - j + 1) * (n - j + 1))
                j -= 1
            rows.append([repr(p), str(N), str(M), str(n), str(klow[0]), klow[1], str(kup[0]), kup[1]])
    write_rows(os.path.join(OUT, "elv_hypergeo_quantiles.csv"),
               "p,N,M,n,k_lower,f_lower,k_upper,f_upper", rows)


if __name__ == "__main__":
    import sys
    which = sys.argv[1:] or ["normal", "t", "hyper"]
    if "normal" in which:
        gen_normal()
        gen_normal_far_tail()
    if "t" in which:
        gen_t_central()
    if "hyper" in which:
        gen_hyper()
