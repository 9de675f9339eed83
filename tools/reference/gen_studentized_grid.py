"""Studentized range upper tails on a grid, by a fast mpmath double integral.

P(Q > q) = int_0^inf f(s) V_k(q s) ds, with f the density of s = sqrt(chi2_df / df),
f(s) = 2 (df/2)^(df/2) s^(df-1) exp(-df s^2/2) / Gamma(df/2), and V_k = 1 - W_k the
upper tail of the range of k standard normals. Since k int phi Phi^(k-1) dz = 1,

    V_k(w) = k int phi(z) [Phi(z)^(k-1) - (Phi(z) - Phi(z - w))^(k-1)] dz,

formed without the subtraction 1 - W_k. With a = Phi(z), b = Phi(z - w) the bracket
is a^(k-1) - (a - b)^(k-1); where b < 1e-8 a it is taken as
-a^(k-1) expm1((k-1) log1p(-b/a)), so no term loses digits.

Method (30 digits):
  * V_k(w) by the trapezoidal rule on z in [-7.5, 11] (the integrand is entire and
    decays like a Gaussian at both ends, so the rule converges exponentially;
    Trefethen and Weideman, SIAM Review 56, 2014), steps h and h/2; the nodes of h
    are a subset of those of h/2, |T_h - T_h/2| is the error estimate.
  * V_k on w in [0, 17] by piecewise Chebyshev-Lobatto interpolation on pieces of
    width 1 / ceil(k / 20) (V_k steepens with k),
    degrees n and 2n (nested nodes); their largest difference at the midpoints of
    the finer nodes is the error estimate. Beyond w = 17, V_k < 1e-26 is taken as 0.
  * The outer integral in t = log s, over the support where f(s) s > 1e-28, by
    Gauss-Legendre panels graded from the chi peak (t = 0, width 1/sqrt(2 df)) and
    from the centre of V_k(q s); n and 2n points per panel, the difference is the
    error estimate.
The error estimate of a row is the sum of the three (the inner ones enter as
sup |dV| since int f = 1). Rows above 1e-15 relative are not written.
k = 2 also has the closed form P(|T_df| > q / sqrt(2)) = I_{df/(df+q^2/2)}(df/2, 1/2):
that value is written, its difference from the quadrature is the row's error.

The q of each (k, df, P) comes from tests/data/studentized_range_r.csv (R's root
near P = 0.5, 0.1, 0.05, 0.01, 0.001); the rows are exact (k, df, q, P(Q > q)).
Writes tests/data/studentized_range_grid_mp.csv: k, df, q, upper, error estimate.
Run from the repository root (1 to 6 minutes per k, k = 100 the longest; about 25 in all):
    python3 tools/reference/gen_studentized_grid.py [k ...]
"""
import math
import sys

from mpmath import mp, mpf

mp.dps = 30

OUT = "tests/data/studentized_range_grid_mp.csv"
Z_LO, Z_HI, Z_STEP = mpf(-7.5), mpf(11), mpf(1) / 20  # the fine trapezoid step
W_MAX = 17
CHEB_N = 20
GL_N = 10
SKIP = -80.0  # natural log of a negligible term


def log_ncdf_float(x):
    """ln Phi(x) in double, for the skip test only."""
    if x > -30:
        return math.log(0.5 * math.erfc(-x / math.sqrt(2)))
    return -x * x / 2 - math.log(-x) - 0.5 * math.log(2 * math.pi)


class RangeTail:
    """V_k(w) = P(range of k normals > w) by the trapezoidal rule in z."""

    def __init__(self, k):
        self.k = k
        n = int((Z_HI - Z_LO) / Z_STEP)
        self.nodes = []
        for j in range(n + 1):
            z = Z_LO + j * Z_STEP
            a = mp.ncdf(z)
            phi = mp.npdf(z)
            big = a ** (k - 1)
            log_all = float(mp.log(k * phi * big))
            log_diff = float(mp.log(k * (k - 1) * phi * a ** (k - 2))) if k > 2 else float(
                mp.log(k * phi))
            self.nodes.append((j % 2 == 0, z, a, phi, big, log_all, log_diff))

    def __call__(self, w):
        k = self.k
        fine = coarse = mpf(0)
        for even, z, a, phi, big, log_all, log_diff in self.nodes:
            if log_all < SKIP:
                continue
            x = z - w
            if log_diff + log_ncdf_float(float(x)) < SKIP:
                continue
            b = mp.ncdf(x)
            if b < a * mpf(1e-8):
                d = -big * mp.expm1((k - 1) * mp.log1p(-b / a))
            else:
                d = big - (a - b) ** (k - 1)
            term = phi * d
            fine += term
            if even:
                coarse += term
        fine *= k * Z_STEP
        coarse *= k * 2 * Z_STEP
        return fine, abs(fine - coarse)


def lobatto(n):
    return [-mp.cos(mp.pi * j / n) for j in range(n + 1)]


def bary(xs, ys, x):
    """Barycentric interpolation on Chebyshev-Lobatto points (Berrut and Trefethen 2004)."""
    num = den = mpf(0)
    n = len(xs) - 1
    for j, (xj, yj) in enumerate(zip(xs, ys)):
        d = x - xj
        if d == 0:
            return yj
        lam = (-1) ** j * (mpf(1) / 2 if j in (0, n) else 1)
        num += lam * yj / d
        den += lam / d
    return num / den


class Interpolant:
    """Piecewise Chebyshev interpolant of V_k on [0, W_MAX], with error estimates."""

    def __init__(self, k):
        tail = RangeTail(k)
        self.inner_err = mpf(0)
        self.interp_err = mpf(0)
        self.pieces = []
        fine_t = lobatto(2 * CHEB_N)
        self.per_unit = -(-k // 20)
        for j in range(W_MAX * self.per_unit):
            lo = mpf(j) / self.per_unit
            xs = [lo + (t + 1) / (2 * self.per_unit) for t in fine_t]
            ys = []
            for x in xs:
                v, e = tail(x)
                ys.append(v)
                self.inner_err = max(self.inner_err, e)
            coarse_x, coarse_y = xs[::2], ys[::2]
            for j in range(len(xs) - 1):
                m = (xs[j] + xs[j + 1]) / 2
                diff = abs(bary(xs, ys, m) - bary(coarse_x, coarse_y, m))
                self.interp_err = max(self.interp_err, diff)
            self.pieces.append((xs, ys))

    def __call__(self, w):
        if w >= W_MAX:
            return mpf(0)
        xs, ys = self.pieces[int(w * self.per_unit)]
        return bary(xs, ys, w)


def legendre(n):
    """Gauss-Legendre nodes and weights on [-1, 1] by Newton's method."""
    out = []
    for i in range(1, n + 1):
        x = mp.cos(mp.pi * (i - mpf(1) / 4) / (n + mpf(1) / 2))
        for _ in range(100):
            p0, p1 = mpf(1), x
            for m in range(2, n + 1):
                p0, p1 = p1, ((2 * m - 1) * x * p1 - (m - 1) * p0) / m
            dp = n * (x * p1 - p0) / (x * x - 1)
            dx = p1 / dp
            x -= dx
            if abs(dx) < mpf(10) ** (-mp.dps - 3):
                break
        out.append((x, 2 / ((1 - x * x) * dp * dp)))
    return out


RULE_N, RULE_2N = legendre(GL_N), legendre(2 * GL_N)


def log_chi_t(t, df):
    """ln(f(s) s) at s = e^t."""
    return (mp.log(2) + df / 2 * mp.log(df / 2) - mp.loggamma(df / 2) + df * t -
            df * mp.exp(2 * t) / 2)


def support(df, lo, hi, cut):
    """The t where ln(f s) falls to cut, left of 0 and right of 0 (bisection)."""
    def find(a, b):
        # log_chi_t(a) < cut <= log_chi_t(b) or the reverse; 200 halvings.
        for _ in range(200):
            m = (a + b) / 2
            if (log_chi_t(m, df) < cut) == (log_chi_t(a, df) < cut):
                a = m
            else:
                b = m
        return (a + b) / 2
    return find(mpf(lo), mpf(0)), find(mpf(0), mpf(hi))


def panels(t_lo, t_hi, centres):
    """Breakpoints graded from each (centre, width): width + |t - centre| / 4, at most 2."""
    cuts = [t_lo]
    t = t_lo
    while t < t_hi:
        step = min([2] + [h + abs(t - c) / 4 for c, h in centres])
        t = min(t + step, t_hi)
        cuts.append(t)
    return cuts


def upper_tail(q, df, tail_v, w_med):
    t_lo, t_hi = support(df, -1000, 50, mp.log(mpf(10) ** -28))
    t_hi = min(t_hi, mp.log(W_MAX / q))
    if t_hi <= t_lo:
        return mpf(0), mpf(0)
    sigma = 1 / mp.sqrt(2 * df)
    centres = [(mpf(0), min(sigma, mpf(0.1))), (mp.log(w_med / q), mpf(0.05))]
    cuts = panels(t_lo, t_hi, centres)
    total = {GL_N: mpf(0), 2 * GL_N: mpf(0)}
    for a, b in zip(cuts, cuts[1:]):
        mid, half = (a + b) / 2, (b - a) / 2
        for rule in (RULE_N, RULE_2N):
            part = mpf(0)
            for x, wt in rule:
                t = mid + half * x
                part += wt * mp.exp(log_chi_t(t, df)) * tail_v(q * mp.exp(t))
            total[len(rule)] += half * part
    return total[2 * GL_N], abs(total[2 * GL_N] - total[GL_N])


def grid_points():
    rows = {}
    with open("tests/data/studentized_range_r.csv") as f:
        for line in f:
            if line.startswith("#"):
                continue
            k, df, q, _ = line.strip().split(",")
            rows.setdefault(int(k), []).append((df, q))
    return rows


def closed_k2(q, df):
    return mp.betainc(df / 2, mpf(1) / 2, 0, df / (df + q * q / 2), regularized=True)


def median_range(tail_v):
    a, b = mpf(0), mpf(W_MAX)
    for _ in range(60):
        m = (a + b) / 2
        a, b = (m, b) if tail_v(m) > mpf(1) / 2 else (a, m)
    return a


def check_against_quad(k, tail_v, w_med):
    """Prints the relative difference from the mp.quad values of gen_studentized_range.py."""
    with open("tests/data/studentized_range_mp.csv") as f:
        for line in f:
            if line.startswith("#") or int(line.split(",")[0]) != k:
                continue
            _, df_s, q_s, ref = line.strip().split(",")
            p, err = upper_tail(mpf(q_s), mpf(df_s), tail_v, w_med)
            print("check k=%d df=%s q=%s: %s vs quad %s, rel diff %s, est %s" %
                  (k, df_s, q_s, mp.nstr(p, 20), ref, mp.nstr((p - mpf(ref)) / p, 3),
                   mp.nstr(err / p, 3)), flush=True)


def main(ks):
    points = grid_points()
    import os
    fresh = len(sys.argv) == 1 or not os.path.exists(OUT)
    with open(OUT, "w" if fresh else "a") as out:
        if fresh:
            out.write("# From tools/reference/gen_studentized_grid.py (mpmath, 30 digits).\n"
                      "# k,df,q,upper,error estimate\n")
        for k in ks:
            tail_v = Interpolant(k)
            w_med = median_range(tail_v)
            print("k=%d inner %.1e interp %.1e median %s" %
                  (k, tail_v.inner_err, tail_v.interp_err, mp.nstr(w_med, 8)), flush=True)
            check_against_quad(k, tail_v, w_med)
            for df_s, q_s in points[k]:
                q, df = mpf(q_s), mpf(df_s)
                p, err = upper_tail(q, df, tail_v, w_med)
                err += tail_v.inner_err + tail_v.interp_err
                if k == 2:
                    exact = closed_k2(q, df)
                    err, p = max(err, abs(p - exact)), exact
                rel = err / p
                print(k, df_s, q_s, mp.nstr(p, 20), mp.nstr(rel, 3), flush=True)
                if rel < mpf(10) ** -15:
                    out.write("%d,%s,%s,%s,%s\n" % (k, df_s, q_s, mp.nstr(p, 25),
                                                    mp.nstr(err, 3)))
                    out.flush()


if __name__ == "__main__":
    main([int(a) for a in sys.argv[1:]] or [2, 3, 5, 10, 20, 40, 100])
