"""Reference values of the location tests: one-sample t and z, paired t and
the two-sample t, pooled and Welch (Satterthwaite degrees of freedom rounded
down), for every interval type and alternative.

Means and variances are exact: every sample value is the double written to
the samples file, read as a Fraction. Square roots, t and normal quantiles
and tail probabilities come from mpmath at 60 digits: the t law through the
regularised incomplete beta function, P(T > t) = I_{v/(v+t^2)}(v/2, 1/2) / 2
for t > 0, its quantile by Newton's method on that tail; the normal law
through erfc and erfinv.

Interval type: -1 upper bound only, 0 two-sided, 1 lower bound only; a
one-sided interval uses the quantile at the confidence level itself, a
two-sided one at (1 + confidence) / 2. Alternative: -1 lower tail, 1 upper
tail, 0 twice the smaller tail.

Writes tests/data/location_samples.csv (name, values...) and
tests/data/location_tests.csv, one row a case:
  test, first sample, second sample (or -), confidence, type, alternative,
  hypothesised value, sigma (z only, else nan), then the expected
  estimate, deviation, standard error, degrees of freedom, lower limit,
  upper limit, statistic and P-value.
The estimate is the mean (t, z), the mean difference (paired) or the
difference of means (two-sample); the deviation is the sample deviation,
that of the differences, or the pooled deviation (nan for Welch).

Run with /usr/bin/python3 (mpmath 1.2.1).
"""
import math
import os
import random
import sys
from fractions import Fraction

import mpmath

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
from refdata import fmt  # noqa: E402

mpmath.mp.dps = 60
HERE = os.path.dirname(os.path.abspath(__file__))
DATA = os.path.join(HERE, "..", "..", "tests", "data")
INF = mpmath.inf


def make_samples():
    rng = random.Random(20261123)
    samples = {}

    def draw(name, n, centre, spread, digits):
        samples[name] = [round(rng.gauss(centre, spread), digits) for _ in range(n)]

    draw("small3", 3, 5.0, 1.0, 2)
    draw("a10", 10, 12.5, 2.0, 3)
    draw("b10", 10, 11.0, 2.5, 3)
    draw("c25", 25, -3.0, 0.4, 4)
    draw("d40", 40, -2.7, 1.5, 4)
    draw("e7", 7, 1000.0, 0.01, 5)
    draw("f7", 7, 1000.02, 0.03, 5)
    samples["two"] = [1.5, 4.0]
    samples["twob"] = [0.25, 1.0]
    return samples


def moments(values):
    xs = [Fraction(v) for v in values]
    n = len(xs)
    mean = sum(xs) / n
    var = sum((x - mean) ** 2 for x in xs) / (n - 1)
    return n, mean, var


def mp(f):
    return mpmath.mpf(f.numerator) / f.denominator


def t_upper(t, v):
    t = mpmath.mpf(t)
    v = mpmath.mpf(v)
    if t == 0:
        return mpmath.mpf(1) / 2
    half = mpmath.betainc(v / 2, mpmath.mpf(1) / 2, 0, v / (v + t * t), regularized=True) / 2
    return half if t > 0 else 1 - half


def t_density(t, v):
    v = mpmath.mpf(v)
    return mpmath.gamma((v + 1) / 2) / (mpmath.sqrt(v * mpmath.pi) * mpmath.gamma(v / 2)) * \
        (1 + t * t / v) ** (-(v + 1) / 2)


def t_quantile(p, v):
    p = mpmath.mpf(p)
    t = mpmath.sqrt(2) * mpmath.erfinv(2 * p - 1)  # normal start
    for _ in range(200):
        step = ((1 - t_upper(t, v)) - p) / t_density(t, v)
        t -= step
        if abs(step) < mpmath.mpf(10) ** -50 * (1 + abs(t)):
            break
    else:
        raise RuntimeError("t quantile did not converge")
    return t


def n_upper(z):
    return mpmath.erfc(z / mpmath.sqrt(2)) / 2


def n_quantile(p):
    return mpmath.sqrt(2) * mpmath.erfinv(2 * mpmath.mpf(p) - 1)


def p_value(stat, upper_tail, alternative):
    up = upper_tail(stat)
    lo = 1 - up
    if alternative == -1:
        return lo
    if alternative == 1:
        return up
    return 2 * min(lo, up)


def interval(quantile, confidence, itype, estimate, se):
    conf = mpmath.mpf(confidence)
    if itype == 0:
        q = quantile((1 + conf) / 2)
        return estimate - se * q, estimate + se * q
    q = quantile(conf)
    if itype == 1:
        return estimate - se * q, INF
    return -INF, estimate + se * q


CONFIDENCES = [0.95, 0.9, 0.99]


def options():
    k = 0
    for itype in (-1, 0, 1):
        for alternative in (-1, 0, 1):
            yield CONFIDENCES[k % 3], itype, alternative
            k += 1


def t_case(test, a, b, values_a, values_b, hypothesised, sigma=None, pooled=None):
    rows = []
    if test in ("t1", "z1"):
        n, mean, var = moments(values_a)
        estimate, dev = mp(mean), mpmath.sqrt(mp(var))
        if test == "t1":
            se, df = dev / mpmath.sqrt(n), mpmath.mpf(n - 1)
        else:
            se, df = mpmath.mpf(sigma) / mpmath.sqrt(n), None
    elif test == "paired":
        diffs = [Fraction(x) - Fraction(y) for x, y in zip(values_a, values_b)]
        n = len(diffs)
        mean = sum(diffs) / n
        var = sum((d - mean) ** 2 for d in diffs) / (n - 1)
        estimate, dev = mp(mean), mpmath.sqrt(mp(var))
        se, df = dev / mpmath.sqrt(n), mpmath.mpf(n - 1)
    else:
        n1, m1, v1 = moments(values_a)
        n2, m2, v2 = moments(values_b)
        estimate = mp(m1 - m2)
        if test == "pooled":
            dfi = n1 + n2 - 2
            pooled_var = ((n1 - 1) * v1 + (n2 - 1) * v2) / dfi
            dev = mpmath.sqrt(mp(pooled_var))
            se = mpmath.sqrt(mp(pooled_var * (Fraction(1, n1) + Fraction(1, n2))))
            df = mpmath.mpf(dfi)
        else:
            s1, s2 = v1 / n1, v2 / n2
            ratio = (s1 + s2) ** 2 / (s1 * s1 / (n1 - 1) + s2 * s2 / (n2 - 1))
            df_floor = math.floor(ratio)
            if ratio - df_floor < Fraction(1, 10 ** 9) or df_floor + 1 - ratio < Fraction(1, 10 ** 9):
                raise RuntimeError("Welch degrees of freedom too near a whole number")
            df = mpmath.mpf(df_floor)
            dev = None
            se = mpmath.sqrt(mp(s1 + s2))
    for confidence, itype, alternative in options():
        if df is None:
            lower, upper = interval(n_quantile, confidence, itype, estimate, se)
            stat = (estimate - mpmath.mpf(hypothesised)) / se
            pv = p_value(stat, n_upper, alternative)
        else:
            lower, upper = interval(lambda p: t_quantile(p, df), confidence, itype, estimate, se)
            stat = (estimate - mpmath.mpf(hypothesised)) / se
            pv = p_value(stat, lambda t: t_upper(t, df), alternative)
        rows.append([test, a, b, repr(confidence), str(itype), str(alternative),
                     repr(float(hypothesised)), "nan" if sigma is None else repr(float(sigma)),
                     estimate, dev, se, df, lower, upper, stat, pv])
    return rows


def main():
    samples = make_samples()
    rows = []
    rows += t_case("t1", "small3", "-", samples["small3"], None, 4.0)
    rows += t_case("t1", "a10", "-", samples["a10"], None, 11.0)
    rows += t_case("t1", "c25", "-", samples["c25"], None, -3.0)
    rows += t_case("t1", "e7", "-", samples["e7"], None, 1000.0)
    rows += t_case("t1", "two", "-", samples["two"], None, 0.0)
    rows += t_case("z1", "a10", "-", samples["a10"], None, 11.5, sigma=2.0)
    rows += t_case("z1", "d40", "-", samples["d40"], None, -3.0, sigma=1.25)
    rows += t_case("z1", "small3", "-", samples["small3"], None, 5.0, sigma=0.5)
    rows += t_case("paired", "a10", "b10", samples["a10"], samples["b10"], 0.0)
    rows += t_case("paired", "e7", "f7", samples["e7"], samples["f7"], -0.01)
    rows += t_case("paired", "two", "twob", samples["two"], samples["twob"], 1.0)
    for test in ("pooled", "welch"):
        rows += t_case(test, "a10", "b10", samples["a10"], samples["b10"], 0.0)
        rows += t_case(test, "c25", "d40", samples["c25"], samples["d40"], 0.5)
        rows += t_case(test, "e7", "f7", samples["e7"], samples["f7"], 0.0)
        rows += t_case(test, "small3", "two", samples["small3"], samples["two"], 2.0)

    with open(os.path.join(DATA, "location_samples.csv"), "w") as out:
        out.write("# name, values (generated by tools/reference/gen_location_tests.py)\n")
        for name, values in samples.items():
            out.write(",".join([name] + [repr(v) for v in values]) + "\n")
    with open(os.path.join(DATA, "location_tests.csv"), "w") as out:
        out.write("# test,first,second,confidence,type,alternative,hypothesised,sigma,"
                  "estimate,deviation,standard error,df,lower,upper,statistic,P-value\n")
        out.write("# generated by tools/reference/gen_location_tests.py with mpmath "
                  + mpmath.__version__ + "\n")
        for row in rows:
            out.write(",".join(r if isinstance(r, str) else fmt(r) for r in row) + "\n")


if __name__ == "__main__":
    main()
