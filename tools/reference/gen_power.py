#!/usr/bin/env python3
"""Power formulas evaluated in mpmath at 30 digits.

The noncentral t tails come from quadrature, for t > 0:
  P(T > t; nu, d) = int_0^inf phi(w - d) P(chi2_nu < nu w^2 / t^2) dw,
(T = (Z + d) / sqrt(V / nu) > t iff V < nu (Z + d)^2 / t^2, with w = Z + d),
and P(T < -t; nu, d) = P(T > t; nu, -d). Fractional nu is allowed (Welch).
The other designs are the normal approximations and Bonett's and Levene's
formulas written out directly.

Writes tests/data/power_mpmath.csv, rows
  t,type,alternative,n,effect,sigma,level,power        (type one/two; z too)
  z,type,alternative,n,effect,sigma,level,power
  prop1,alternative,n,null,effect,level,power          (one proportion)
  poisson,samples,alternative,n,rate,effect,level,L1,L2,power
  bonett,samples,alternative,n,ratio,level,kurtosis,power (ratio of variances)
  levene,alternative,n1,n2,ratio,level,power            (ratio of variances)
  welch,alternative,n1,n2,difference,s1,s2,level,power
Run: python3 tools/reference/gen_power.py
"""
import os

import mpmath as mp

mp.mp.dps = 30
HERE = os.path.dirname(os.path.abspath(__file__))
OUT = os.path.join(HERE, "..", "..", "tests", "data", "power_mpmath.csv")


def phi(x):
    return mp.npdf(x)


def upper_normal(x):
    return mp.erfc(x / mp.sqrt(2)) / 2


def lower_normal(x):
    return upper_normal(-x)


def normal_quantile_upper(a):
    return -mp.sqrt(2) * mp.erfinv(2 * mp.mpf(a) - 1)


def nct_upper(t, nu, d):
    t, nu, d = mp.mpf(t), mp.mpf(nu), mp.mpf(d)
    f = lambda w: phi(w - d) * mp.gammainc(nu / 2, 0, nu * w * w / (2 * t * t), regularized=True)
    peak = (d + mp.sqrt(d * d + 4 * nu)) / 2
    points = sorted({mp.mpf(0)} | {peak + k for k in (-16, -8, -4, -2, -1, 0, 1, 2, 4, 8, 16)
                                  if peak + k > 0})
    return mp.quad(f, points + [mp.inf])


def t_upper_central(t, nu):
    nu = mp.mpf(nu)
    return mp.betainc(nu / 2, mp.mpf(1) / 2, 0, nu / (nu + t * t), regularized=True) / 2


def t_quantile_upper(a, nu):
    # Bisection on [0, 1e4]: the upper tail falls as t grows.
    lo, hi = mp.mpf(0), mp.mpf(10000)
    for _ in range(130):
        mid = (lo + hi) / 2
        if t_upper_central(mid, nu) > a:
            lo = mid
        else:
            hi = mid
    return (lo + hi) / 2


def parts(alternative, upper, lower):
    p = mp.mpf(0)
    if alternative >= 0:
        p += upper()
    if alternative <= 0:
        p += lower()
    return p


def t_power(alternative, nu, ncp, level):
    a = level / 2 if alternative == 0 else level
    t = t_quantile_upper(mp.mpf(a), nu)
    return parts(alternative, lambda: nct_upper(t, nu, ncp), lambda: nct_upper(t, nu, -ncp))


def z_power(alternative, ncp, level):
    a = level / 2 if alternative == 0 else level
    c = normal_quantile_upper(mp.mpf(a))
    return parts(alternative, lambda: upper_normal(c - ncp), lambda: lower_normal(-(ncp + c)))


def g(x):
    return mp.nstr(x, 20, strip_zeros=False)


def main():
    rows = []
    m = mp.mpf
    for kind in ("t", "z"):
        for typ in ("one", "two"):
            for alt in (-1, 0, 1):
                for n in (4, 12, 50, 300):
                    for effect in (-3.0, -1.2, -0.4, 0.0, 0.25, 0.9, 2.0):
                        sigma, level = 1.3, 0.05
                        scale = mp.sqrt(n) if typ == "one" else mp.sqrt(m(n) / 2)
                        ncp = m(effect) / m(sigma) * scale
                        if kind == "t":
                            nu = n - 1 if typ == "one" else 2 * n - 2
                            p = t_power(alt, nu, ncp, m(level))
                        else:
                            p = z_power(alt, ncp, m(level))
                        if p < m("1e-13") or p > 1 - m("1e-13"):
                            continue
                        rows.append([kind, typ, alt, n, effect, sigma, level, g(p)])
    for alt in (-1, 0, 1):
        for n in (10, 80, 1500):
            for null in (0.2, 0.5, 0.9):
                for effect in (-0.15, -0.05, 0.05, 0.09):
                    p1 = m(null) + m(effect)
                    v1, v0 = p1 * (1 - p1), m(null) * (1 - m(null))
                    s1, s0 = mp.sqrt(v1 / n), mp.sqrt(v0 / n)
                    a = 0.025 if alt == 0 else 0.05
                    c = normal_quantile_upper(m(a))
                    p = parts(alt, lambda: upper_normal((c * s0 - effect) / s1),
                              lambda: lower_normal(-(effect + c * s0) / s1))
                    if p < m("1e-13"):
                        continue
                    rows.append(["prop1", alt, n, null, effect, 0.05, g(p)])
    for samples in (1, 2):
        for alt in (-1, 0, 1):
            for n in (3, 20, 400):
                for rate, effect in ((2.0, 0.5), (2.0, -1.0), (0.3, 0.2), (5.0, -0.5)):
                    l1, l2 = 1.5, 0.7
                    r = m(rate)
                    r1 = r + m(effect)
                    if samples == 1:
                        s0, s1 = mp.sqrt(r / (l1 * n)), mp.sqrt(r1 / (l1 * n))
                    else:
                        s0 = mp.sqrt((r * l2 + l1 * r1) / (l1 + l2) / n * (1 / m(l1) + 1 / m(l2)))
                        s1 = mp.sqrt((r / l2 + r1 / l1) / n)
                    a = 0.025 if alt == 0 else 0.05
                    z = normal_quantile_upper(m(a))
                    if alt < 0:
                        p = upper_normal((z * s0 + effect) / s1)
                    else:
                        p = upper_normal((z * s0 - effect) / s1)
                        if alt == 0:
                            p += lower_normal(-(z * s0 + effect) / s1)
                    if p < m("1e-13"):
                        continue
                    rows.append(["poisson", samples, alt, n, rate, effect, 0.05, l1, l2, g(p)])
    for samples in (1, 2):
        for alt in (-1, 0, 1):
            for n in (5, 30, 500):
                for ratio in (0.1, 0.5, 0.9, 1.0, 1.6, 3.0, 20.0):
                    for kurt in (0.0, 2.5):
                        k, n1 = m(kurt), m(n)
                        if samples == 1:
                            v = (k + 2 + 3 / n1) / (n1 - 1)
                        else:
                            v = 2 * ((k + 3) - (n1 - 3) / n1) / (n1 - 1)
                        w = mp.sqrt(v)
                        a = 0.025 if alt == 0 else 0.05
                        c = normal_quantile_upper(m(a))
                        shift = mp.log(m(ratio)) / w
                        p = parts(alt, lambda: upper_normal(c - shift),
                                  lambda: lower_normal(-c - shift))
                        if p < m("1e-13"):
                            continue
                        rows.append(["bonett", samples, alt, n, ratio, 0.05, kurt, g(p)])
    gamma = mp.sqrt(mp.pi / 2 - 1)
    for alt in (-1, 0, 1):
        for n1, n2 in ((5, 5), (12, 30), (200, 150)):
            for ratio in (0.2, 0.7, 1.0, 1.5, 4.0):
                s = mp.sqrt(m(ratio))
                v = s * s
                q = m(n1) / n2
                f = mp.sqrt((q + v) / (v * q + 1))
                a = 0.025 if alt == 0 else 0.05
                t = t_quantile_upper(m(a), n1 + n2 - 2)
                mm = (s - 1) / (gamma * mp.sqrt(v / n1 + m(1) / n2))
                p = parts(alt, lambda: upper_normal(t / f - mm), lambda: lower_normal(-t / f - mm))
                if p < m("1e-13"):
                    continue
                rows.append(["levene", alt, n1, n2, ratio, 0.05, g(p)])
    for alt in (-1, 0, 1):
        for n1, n2, s1, s2 in ((5, 9, 1.0, 3.0), (20, 12, 2.5, 0.8), (60, 60, 1.0, 1.7)):
            for diff in (-2.5, -0.6, 0.0, 0.4, 1.5, 4.0):
                a1, a2 = m(s1) ** 2 / n1, m(s2) ** 2 / n2
                nu = (a1 + a2) ** 2 / (a1 ** 2 / (n1 - 1) + a2 ** 2 / (n2 - 1))
                ncp = m(diff) / mp.sqrt(a1 + a2)
                p = t_power(alt, nu, ncp, m("0.05"))
                if p < m("1e-13"):
                    continue
                rows.append(["welch", alt, n1, n2, diff, s1, s2, 0.05, g(p)])
    with open(OUT, "w") as out:
        out.write("# generated by tools/reference/gen_power.py with mpmath %s\n" % mp.__version__)
        for r in rows:
            out.write(",".join(str(x) for x in r) + "\n")


if __name__ == "__main__":
    main()
