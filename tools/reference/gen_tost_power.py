#!/usr/bin/env python3
"""Reference powers of the two one-sided tests (TOST) of equivalence.

Writes tests/data/tost_power.csv with columns
  type, n, d, sigma, level, lower, upper, approx, exact
type 2 is two independent samples of n each (df = 2n - 2, se = sigma
sqrt(2/n)); types 0 and 1 are one sample or paired (df = n - 1, se =
sigma / sqrt(n)).

approx: T(-t; df, b) - T(t; df, a) clamped at 0, with t the central t
quantile at 1 - level, a = (d - lower)/se, b = (d - upper)/se, and the
noncentral t cdf by quadrature over the chi distribution of S/sigma:
  T(x; df, delta) = int_0^inf Phi(x u - delta) h(u) du.
exact: the probability that both one-sided tests reject (Owen 1965),
  int_0^umax [Phi((upper - d)/se - t u) - Phi((lower - d)/se + t u)] h(u) du,
umax = (upper - lower) / (2 t se), h the density of sqrt(chi2_df / df).
"""
import csv
import os

import mpmath as mp

mp.mp.dps = 30


def chi_density(df):
    df = mp.mpf(df)
    c = mp.log(2) * (1 - df / 2) + (df / 2) * mp.log(df) - mp.loggamma(df / 2)
    return lambda u: mp.exp(c + (df - 1) * mp.log(u) - df * u * u / 2) if u > 0 else mp.mpf(0)


def breakpoints(df):
    sd = 1 / mp.sqrt(2 * df)
    return [0] + [max(mp.mpf('1e-8'), 1 + k * sd) for k in (-8, -4, -2, 0, 2, 4, 8)] + [mp.inf]


def nct_cdf(x, df, delta):
    h = chi_density(df)
    pts = sorted(set(breakpoints(df)))
    return mp.quad(lambda u: mp.ncdf(x * u - delta) * h(u), pts)


def t_quantile(p, df):
    return mp.findroot(lambda x: mp.betainc(df / 2, mp.mpf(1) / 2, 0, df / (df + x * x),
                                            regularized=True) / 2 - (1 - p), 1.7)


def powers(tt, n, d, sigma, level, lower, upper):
    df = mp.mpf(2 * n - 2 if tt == 2 else n - 1)
    se = mp.mpf(sigma) * mp.sqrt(mp.mpf(2 if tt == 2 else 1) / n)
    t = t_quantile(1 - mp.mpf(level), df)
    a = (mp.mpf(d) - lower) / se
    b = (mp.mpf(d) - upper) / se
    approx = max(nct_cdf(-t, df, b) - nct_cdf(t, df, a), mp.mpf(0))
    h = chi_density(df)
    umax = (mp.mpf(upper) - lower) / (2 * t * se)
    pts = [p for p in breakpoints(df) if p < umax] + [umax]
    exact = mp.quad(lambda u: (mp.ncdf((upper - mp.mpf(d)) / se - t * u) -
                               mp.ncdf((lower - mp.mpf(d)) / se + t * u)) * h(u), pts)
    return approx, exact


CASES = [
    # type, n, d, sigma, level, lower, upper
    (2, 3, 0.0, 1.0, 0.05, -1.0, 1.0),
    (2, 5, 0.0, 1.0, 0.05, -1.0, 1.0),
    (2, 10, -0.3, 1.0, 0.05, -1.0, 1.0),
    (2, 20, 0.3, 1.0, 0.05, -1.0, 1.0),
    (2, 30, 0.5, 1.0, 0.05, -1.0, 1.0),
    (2, 100, 0.1, 1.0, 0.05, -0.5, 0.5),
    (2, 1000, 0.2, 2.0, 0.05, -0.5, 0.5),
    (2, 12, 0.05, 0.2, 0.05, -0.2231435513142098, 0.2231435513142098),
    (0, 4, 0.0, 1.0, 0.05, -1.0, 1.0),
    (0, 8, 0.2, 0.5, 0.10, -0.5, 0.5),
    (0, 15, -0.2, 1.0, 0.05, -1.0, 1.0),
    (1, 25, 0.0, 0.3, 0.05, -0.2231435513142098, 0.2231435513142098),
    (1, 60, 0.4, 1.0, 0.05, -0.5, 0.8),
    (0, 200, 0.0, 1.0, 0.01, -0.3, 0.3),
    (2, 6, 0.0, 0.5, 0.10, -1.0, 1.0),
]


def main():
    here = os.path.dirname(os.path.abspath(__file__))
    out = os.path.join(here, '..', '..', 'tests', 'data', 'tost_power.csv')
    with open(out, 'w', newline='') as f:
        w = csv.writer(f, lineterminator='\n')
        f.write('# type,n,d,sigma,level,lower,upper,approx,exact (gen_tost_power.py, mpmath)\n')
        for c in CASES:
            approx, exact = powers(*c)
            w.writerow(list(c) + [mp.nstr(approx, 17), mp.nstr(exact, 17)])


if __name__ == '__main__':
    main()
