"""Reference data for the Anderson-Darling statistic and the maximum-likelihood
fits (normal, lognormal, exponential, Weibull).

Writes tests/data/fits_samples.csv (the samples, one per line: name, sorted
values) and tests/data/fits_reference.csv (name, quantity, values).

- The Anderson-Darling statistic is the defining sum
  A2 = -n - (1/n) sum_{i=1..n} (2i-1) [log F(x_i) + log(1 - F(x_{n+1-i}))]
  evaluated in mpmath at 60 digits, with F at given parameters.
- The Weibull maximum-likelihood estimate solves the profile equation
  sum x^b log x / sum x^b - 1/b - mean(log x) = 0 with mpmath.findroot, the
  scale following as (mean x^b)^(1/b); SciPy's weibull_min.fit(floc=0) is run
  as a cross-check of the maximum (the script stops if they disagree).
- Covariances: the inverse of the observed information, the negated Hessian
  of the log-likelihood by mpmath.diff (numerical differentiation) at the
  estimate. For the normal: the variance of the mean s2/n and the exact
  variance of the standard deviation s2*(1 - c4^2).
- P-values of the approximations (D'Agostino and Stephens) at modified
  statistics on both sides of each breakpoint.
Run with /usr/bin/python3.
"""
import os
import sys

import mpmath
import numpy as np
from scipy import stats

sys.path.insert(0, os.path.dirname(__file__))
from refdata import d, fmt, write_rows  # noqa: E402

mpmath.mp.dps = 60
HERE = os.path.dirname(os.path.abspath(__file__))
DATA = os.path.join(HERE, "..", "..", "tests", "data")

rng = np.random.default_rng(20261123)


def weibull(n, shape, scale):
    return np.sort(scale * rng.weibull(shape, n))


samples = {
    "weib3": weibull(3, 1.7, 3.0),
    "weib10": weibull(10, 1.7, 3.0),
    "weib50": weibull(50, 0.6, 2.0),
    "weib1000": weibull(1000, 3.5, 10.0),
    "weib10000": weibull(10000, 1.2, 0.5),
    "weibtied": np.sort(np.round(weibull(300, 2.0, 1.0), 1) + 0.1),
    "weibtiny": weibull(100, 0.8, 1e-8),
    "weibhuge": weibull(100, 5.0, 1e8),
    "norm3": np.sort(rng.normal(10.0, 2.0, 3)),
    "norm200": np.sort(rng.normal(-3.0, 0.5, 200)),
    "lnorm5": np.sort(rng.lognormal(1.0, 0.8, 5)),
    "lnorm400": np.sort(rng.lognormal(-2.0, 1.5, 400)),
    "exp3": np.sort(rng.exponential(2.5, 3)),
    "exp500": np.sort(rng.exponential(0.01, 500)),
}
# A sample far from the Weibull (two clusters) for a large statistic.
samples["bimodal"] = np.sort(np.concatenate([rng.normal(1.0, 0.01, 40),
                                             rng.normal(5.0, 0.01, 40)]))


def mpdata(x):
    return [d(v) for v in x]


def ncdf(z):
    return mpmath.ncdf(z)


def ad_sum(xs, cdf):
    n = len(xs)
    total = mpmath.mpf(0)
    for i in range(1, n + 1):
        total += (2 * i - 1) * (mpmath.log(cdf(xs[i - 1])) + mpmath.log(1 - cdf(xs[n - i])))
    return -n - total / n


def normal_ml(xs):
    n = len(xs)
    m = mpmath.fsum(xs) / n
    s2 = mpmath.fsum((x - m) ** 2 for x in xs) / (n - 1)
    h = mpmath.mpf(n) / 2
    c4sq = 2 / mpmath.mpf(n - 1) * (mpmath.gamma(h) / mpmath.gamma(h - mpmath.mpf(1) / 2)) ** 2
    return m, mpmath.sqrt(s2), s2 / n, s2 * (1 - c4sq)


def weibull_loglik(xs, slx):
    n = len(xs)

    def ll(b, a):
        return n * mpmath.log(b) - n * b * mpmath.log(a) + (b - 1) * slx - mpmath.fsum(
            (x / a) ** b for x in xs)
    return ll


def weibull_ml(xs, guess):
    n = len(xs)
    lx = [mpmath.log(x) for x in xs]
    mlx = mpmath.fsum(lx) / n
    # Work on x / max(x): the shape equation is scale-free.
    top = max(xs)
    u = [x / top for x in xs]
    lu = [mpmath.log(v) for v in u]

    def g(b):
        p = [v ** b for v in u]
        return mpmath.fsum(pi * li for pi, li in zip(p, lu)) / mpmath.fsum(p) - 1 / b - (
            mlx - mpmath.log(top))
    b = mpmath.findroot(g, mpmath.mpf(guess), tol=mpmath.mpf(10) ** -50)
    a = top * (mpmath.fsum(v ** b for v in u) / n) ** (1 / b)
    return b, a


def weibull_cov(xs, b, a):
    old = mpmath.mp.dps
    mpmath.mp.dps = 40
    slx = mpmath.fsum(mpmath.log(x) for x in xs)
    ll = weibull_loglik(xs, slx)
    # Differentiate in the relative parameters to keep the steps well scaled.
    f = lambda u, v: ll(b * u, a * v)  # noqa: E731
    h11 = mpmath.diff(f, (1, 1), (2, 0)) / b ** 2
    h12 = mpmath.diff(f, (1, 1), (1, 1)) / (a * b)
    h22 = mpmath.diff(f, (1, 1), (0, 2)) / a ** 2
    m = mpmath.matrix([[-h11, -h12], [-h12, -h22]]) ** -1
    mpmath.mp.dps = old
    return m[0, 0], m[0, 1], m[1, 1]


ref = []
sample_rows = []
for name, x in samples.items():
    sample_rows.append([name] + [repr(float(v)) for v in x])
    xs = mpdata(x)
    n = len(xs)
    if name.startswith("weib") or name == "bimodal":
        shp, loc, scl = stats.weibull_min.fit(x, floc=0)
        b, a = weibull_ml(xs, shp)
        if abs(b / shp - 1) > 1e-4 or abs(a / scl - 1) > 1e-4:
            sys.exit("SciPy and mpmath disagree on %s: %r %r / %s %s" % (name, shp, scl, b, a))
        cov = weibull_cov(xs, b, a)
        ref.append([name, "weibull_ml", b, a])
        if cov[0] is not None:
            ref.append([name, "weibull_cov", cov[0], cov[1], cov[2]])
        # AD at the rounded estimate, which the test passes as doubles.
        bd, ad = d(float(b)), d(float(a))
        ref.append([name, "ad_weibull", bd, ad,
                    ad_sum(xs, lambda t: 1 - mpmath.exp(-(t / ad) ** bd))])
    if name.startswith("norm") or name == "bimodal":
        m, s, vm, vs = normal_ml(xs)
        ref.append([name, "normal_ml", m, s, vm, vs])
        md, sd = d(float(m)), d(float(s))
        ref.append([name, "ad_normal", md, sd, ad_sum(xs, lambda t: ncdf((t - md) / sd))])
    if name.startswith("lnorm"):
        ls = [mpmath.log(v) for v in xs]
        m, s, vm, vs = normal_ml(ls)
        ref.append([name, "lognormal_ml", m, s, vm, vs])
        md, sd = d(float(m)), d(float(s))
        ref.append([name, "ad_lognormal", md, sd,
                    ad_sum(xs, lambda t: ncdf((mpmath.log(t) - md) / sd))])
    if name.startswith("exp"):
        m = mpmath.fsum(xs) / n
        ref.append([name, "exponential_ml", m, m * m / n])
        md = d(float(m))
        ref.append([name, "ad_exponential", md, ad_sum(xs, lambda t: 1 - mpmath.exp(-t / md))])

# P-value pieces: (family, A*, P) at A* on both sides of each breakpoint.
normal_pieces = [(0.2, lambda a: 1 - mpmath.exp(-13.436 + 101.14 * a - 223.73 * a * a)),
                 (0.34, lambda a: 1 - mpmath.exp(-8.318 + 42.796 * a - 59.938 * a * a)),
                 (0.6, lambda a: mpmath.exp(0.9177 - 4.279 * a - 1.38 * a * a)),
                 (1.159, lambda a: mpmath.exp(1.2937 - 5.709 * a + 0.0186 * a * a))]
exp_pieces = [(0.26, lambda a: 1 - mpmath.exp(-12.2204 + 67.459 * a - 110.3 * a * a)),
              (0.51, lambda a: 1 - mpmath.exp(-6.1327 + 20.218 * a - 18.663 * a * a)),
              (0.95, lambda a: mpmath.exp(0.9209 - 3.353 * a + 0.3 * a * a)),
              (2.534, lambda a: mpmath.exp(0.731 - 3.009 * a + 0.15 * a * a))]


def piece_rows(family, pieces):
    rows = []
    lower = 0.0
    for k, (top, f) in enumerate(pieces):
        mid = (lower + top) / 2
        for a in (mid, top - 1e-6):
            rows.append([family, "pvalue", d(a), f(d(a))])
        # Exactly at the border the lower piece applies.
        rows.append([family, "border", d(top), f(d(top))])
        if k + 1 < len(pieces):
            rows.append([family, "pvalue", d(top + 1e-6), pieces[k + 1][1](d(top + 1e-6))])
        lower = top
    return rows


ref += piece_rows("normal", normal_pieces)
ref += piece_rows("exponential", exp_pieces)

write_rows(os.path.join(DATA, "fits_reference.csv"), "name,quantity,values...", ref)
with open(os.path.join(DATA, "fits_samples.csv"), "w") as out:
    out.write("# sorted samples for fits_reference.csv; numpy default_rng(20261123)\n")
    for row in sample_rows:
        out.write(",".join(row) + "\n")

# Plot scores at Hazen's positions (i + 0.5)/5 and Benard's (i + 0.7)/(n + 0.4)
# for n = 5: the standard normal quantile and log(-log(1 - p)).
scores = []
for method, (a, dd) in (("hazen", (mpmath.mpf(1) / 2, 5)), ("benard", (mpmath.mpf(7) / 10, 5.4))):
    for i in range(5):
        p = (i + a) / d(dd) if method == "benard" else (i + a) / dd
        scores.append([method, "score", i, mpmath.sqrt(2) * mpmath.erfinv(2 * p - 1),
                       mpmath.log(-mpmath.log(1 - p))])
with open(os.path.join(DATA, "fits_reference.csv"), "a") as out:
    for row in scores:
        out.write(",".join(fmt(v) if not isinstance(v, (str, int)) else str(v) for v in row) + "\n")
