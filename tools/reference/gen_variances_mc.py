#!/usr/bin/env python3
"""Reference values of the multiple comparison test of k variances, from the
formulas in mpmath at 32 digits: Bonett's kurtosis and per-sample limits,
the pairwise standard errors c_ij, the Hochberg-Tamhane split V_i, the
pairwise P-values by the normal range law (P(R > r) = 1 - k int phi(x)
(Phi(x + r) - Phi(x))^(k-1) dx), the equation of the lower limit of the
variance ratio for unequal sizes, and the comparison limits. Samples have
at most 5 values, where Bonett's trimmed mean is the mean.

Writes tests/data/variances_mc.csv with rows
  data,<case>,x...              the samples, one row each
  sample,<case>,i,kurtosis,V,bonettLower,bonettUpper,mcLower,mcUpper
  test,<case>,confidence,P
Run: python3 tools/reference/gen_variances_mc.py
"""
import os
import mpmath as mp

mp.mp.dps = 32
HERE = os.path.dirname(os.path.abspath(__file__))
OUT = os.path.join(HERE, "..", "..", "tests", "data", "variances_mc.csv")

CASES = {
    # equal sizes: the normal range law at sqrt(2)|ln r|/se
    "equal4": [[1.5, 2.25, 3.0, 6.5, 4.0], [2.0, 9.0, 3.5, 1.0, 7.25],
               [10.0, 11.0, 10.5, 12.0, 10.25], [0.5, 8.0, 4.0, 2.0, 3.0]],
    # identical spreads shifted: every c_ij equal, so V_i = c/2
    "same3": [[1.0, 2.0, 4.0, 7.0, 11.0], [11.0, 12.0, 14.0, 17.0, 21.0],
              [-5.0, -4.0, -2.0, 1.0, 5.0]],
    # unequal sizes: the lower-limit equation of each pair, both ways
    "mixed5": [[1.5, 2.25, 3.0, 6.5, 4.0], [2.0, 9.0, 3.5, 1.0], [10.0, 11.0, 10.5, 12.0, 10.25],
               [0.5, 8.0, 4.0, 2.0], [3.0, 1.0, 4.0, 1.5, 5.0]],
    # a wide small sample against a tight larger one: 1 lies below every
    # lower limit of their ratio, and the branch top bounds the quantile
    "wide3": [[0.0, 50.0, 100.0, 150.0], [1.0, 1.1, 1.2, 1.05, 1.15], [2.0, 3.0, 4.0, 5.0, 6.0]],
    "two_wide": [[0.0, 50.0, 100.0, 150.0], [1.0, 1.1, 1.2, 1.05, 1.15]],
    # a constant sample: finite V through the zero-variance cases
    "zero3": [[1.5, 2.25, 3.0, 6.5, 4.0], [7.0, 7.0, 7.0, 7.0, 7.0], [2.0, 9.0, 3.5, 1.0, 7.25]],
    # two samples: Bonett's two-sided test on V_1 + V_2
    "two_equal": [[1.5, 2.25, 3.0, 6.5, 4.0], [2.0, 9.0, 3.5, 1.0, 7.25]],
    "two_mixed": [[1.5, 2.25, 3.0, 6.5, 4.0], [2.0, 9.0, 3.5, 1.0]],
}
CONFIDENCES = [mp.mpf("0.9"), mp.mpf("0.95")]


def var(x):
    m = mp.fsum(x) / len(x)
    return mp.fsum((v - m) ** 2 for v in x) / (len(x) - 1)


def kurt(x):
    n = len(x)
    s2 = var(x)
    if s2 == 0:
        return mp.mpf(1)
    m = mp.fsum(x) / n
    return n * mp.fsum((v - m) ** 4 for v in x) / ((n - 1) * s2) ** 2


def gpool(vi, ni, ki, vj, nj, kj):
    wi, wj = (ni - 1) * vi, (nj - 1) * vj
    return (wi ** 2 * ki / ni + wj ** 2 * kj / nj) / (wi + wj) ** 2


def cij(s, i, j):
    (vi, ni, ki), (vj, nj, kj) = s[i], s[j]
    if vi > 0 and vj > 0:
        g = (ni + nj) * (ni - 1 + nj - 1) / mp.mpf((ni - 1) * (nj - 1)) * gpool(vi, ni, ki, vj, nj, kj)
        return mp.sqrt(g - (mp.mpf(ni - 3) / ni / (ni - 1) + mp.mpf(nj - 3) / nj / (nj - 1)))
    if vi > 0:
        return 1 + mp.mpf(ni) / nj
    if vj > 0:
        return mp.mpf(nj) / ni + 1
    return (mp.mpf(ni + nj - 1) / (ni + nj - 2)) ** 2


def range_upper(r, k):
    if r <= 0:
        return mp.mpf(1)
    f = lambda x: mp.npdf(x) * (mp.ncdf(x + r) - mp.ncdf(x)) ** (k - 1)
    return 1 - k * mp.quad(f, [-mp.inf, -r / 2, 0, mp.inf])


def range_density(r, k):
    f = lambda x: mp.npdf(x) * mp.npdf(x + r) * (mp.ncdf(x + r) - mp.ncdf(x)) ** (k - 2)
    return k * (k - 1) * mp.quad(f, [-mp.inf, -r / 2, 0, mp.inf])


def range_quantile(p, k):
    """Newton's method on P(R <= r) = p from r = 3."""
    r = mp.mpf(3)
    for _ in range(60):
        step = ((1 - range_upper(r, k)) - p) / range_density(r, k)
        r -= step
        if abs(step) < mp.mpf(10) ** -28 * r:
            break
    return r


def lower_limit_root(n1, n2, r, se):
    """The z below min(n1, n2) on the falling branch of
    ln(n1/n2) + ln((n2 - z)/(n1 - z)) - z se + ln r; (z, exact) or, when the
    ratio 1 lies below every lower limit, (branch top, False)."""
    f = lambda z: mp.log(mp.mpf(n1) / n2) + mp.log((n2 - z) / (n1 - z)) - z * se + mp.log(r)
    if n1 >= n2:
        top = mp.mpf(n2) - mp.mpf(10) ** -30
    else:
        d = mp.mpf(n2 - n1)
        top = n1 - (-d + mp.sqrt(d * d + 4 * d / se)) / 2
        if f(top) > 0:
            return top, False
    lo = mp.mpf(-1)
    while f(lo) < 0:
        lo *= 2
    return mp.findroot(f, (lo, top), solver="bisect"), True


def analyse(xs, conf):
    k = len(xs)
    s = [(var(x), len(x), kurt(x)) for x in xs]
    ind = 1 - (1 - conf) / k
    rows = []
    if k > 2:
        c = [[cij(s, i, j) if i != j else 0 for j in range(k)] for i in range(k)]
        T = mp.fsum(c[i][j] for i in range(k) for j in range(i + 1, k))
        V = [((k - 1) * mp.fsum(c[i]) - T) / ((k - 1) * (k - 2)) for i in range(k)]
        P = mp.mpf(1)
        for i in range(k):
            for j in range(i + 1, k):
                se, r = V[i] + V[j], s[i][0] / s[j][0] if s[j][0] > 0 else mp.inf
                if s[j][0] > 0 and 0 < r:
                    if s[i][1] == s[j][1]:
                        p = range_upper(mp.sqrt(2) * abs(mp.log(r)) / se, k)
                    else:
                        p = min(range_upper(lower_limit_root(s[i][1], s[j][1], r, se)[0] * mp.sqrt(2), k),
                                range_upper(lower_limit_root(s[j][1], s[i][1], 1 / r, se)[0] * mp.sqrt(2), k))
                else:
                    p = mp.mpf(0)
                P = min(P, p)
        z = range_quantile(conf, k) / mp.sqrt(2)
    else:
        (v1, n1, k1), (v2, n2, k2) = s
        g = gpool(v1, n1, k1, v2, n2, k2)
        u = [mp.mpf(n1 + n2) / (n - 1) * g - mp.mpf(n - 3) / n / (n - 1) for n in (n1, n2)]
        se = mp.sqrt(u[0] + u[1])
        V = [mp.sqrt(u[0]) / (mp.sqrt(u[0]) + mp.sqrt(u[1])) * se,
             se * mp.sqrt(u[1]) / (mp.sqrt(u[0]) + mp.sqrt(u[1]))]
        se = V[0] + V[1]
        r = v1 / v2
        if n1 == n2:
            P = min(1, 2 * mp.ncdf(-abs(mp.log(r)) / se))
        else:
            side = lambda a, b, q: 1 - mp.ncdf(lower_limit_root(a, b, q, se)[0])
            P = min(1, 2 * min(side(n1, n2, r), side(n2, n1, 1 / r)))
        z = mp.sqrt(2) * mp.erfinv(conf)
    zb = mp.sqrt(2) * mp.erfinv(ind)
    for i, (v, n, kk) in enumerate(s):
        f = mp.mpf(n) / (n - zb)
        cc = kk + mp.mpf(3) / n - 1
        w = mp.exp(zb * f * mp.sqrt(cc / (n - 1))) if cc > 0 else mp.nan
        fm = mp.mpf(n) / (n - z)
        e = mp.exp(z * V[i])
        rows.append((i, kk, V[i], f * v / w, f * v * w, fm * v / e, fm * v * e))
    return rows, P


def main():
    lines = ["# generated by tools/reference/gen_variances_mc.py"]
    fmt = lambda v: mp.nstr(v, 17, min_fixed=-mp.inf, max_fixed=mp.inf) if v == v else "nan"
    for name, xs in CASES.items():
        for x in xs:
            lines.append(",".join(["data", name] + [repr(v) for v in x]))
        for conf in CONFIDENCES:
            rows, P = analyse([[mp.mpf(v) for v in x] for x in xs], conf)
            for row in rows:
                lines.append(",".join(["sample", name, fmt(conf)] + [fmt(v) for v in row]))
            lines.append(",".join(["test", name, fmt(conf), fmt(P)]))
    with open(OUT, "w") as f:
        f.write("\n".join(lines) + "\n")


if __name__ == "__main__":
    main()
