#!/usr/bin/env python3
"""Reference values for the Python module's distribution functions, from
SciPy (a peer) and mpmath (far tails, and the t quantile, where SciPy's
is good to 1e-9 only).

Writes tests/data/python_distributions.json: a list of rows
[submodule, function, args, kwargs, expected, rtol], each a call
qel.<submodule>.<function>(*args, **kwargs) and its expected value.
Each family's parameters are translated to SciPy's (shape, loc, scale)
form here; discrete upper tails of qel include the point (P(X >= x) =
sf(x - 1)). Run with Debian's interpreter: /usr/bin/python3
tools/reference/gen_python_scipy.py
"""
import json
import math
import os

import mpmath
from scipy import stats

ROOT = os.path.normpath(os.path.join(os.path.dirname(__file__), "..", ".."))

# qel family: (qel parameters, frozen SciPy law, discrete, points, rtol)
FAMILIES = [
    ("beta", dict(a=2.5, b=0.7), stats.beta(2.5, 0.7), False, [0.1, 0.5, 0.95], 1e-11),
    ("binomial", dict(n=20, p=0.3), stats.binom(20, 0.3), True, [2, 6, 13], 1e-11),
    ("cauchy", dict(location=1.0, scale=2.0), stats.cauchy(1.0, 2.0), False, [-40, 0.5, 7], 1e-12),
    ("chisq", dict(df=4.5), stats.chi2(4.5), False, [0.3, 4.0, 25.0], 1e-11),
    ("exponential", dict(scale=2.0, threshold=1.0), stats.expon(1.0, 2.0), False,
     [1.5, 3.0, 30.0], 1e-12),
    ("f", dict(df1=3.0, df2=11.0), stats.f(3.0, 11.0), False, [0.2, 1.5, 9.0], 1e-10),
    ("gamma", dict(shape=2.2, scale=1.5, threshold=0.5), stats.gamma(2.2, 0.5, 1.5), False,
     [0.9, 3.0, 20.0], 1e-11),
    ("geometric", dict(p=0.2), stats.geom(0.2), True, [1, 4, 20], 1e-11),
    ("halfnormal", dict(scale=2.0, location=1.0), stats.halfnorm(1.0, 2.0), False,
     [1.2, 3.0, 9.0], 1e-11),
    ("hypergeometric", dict(N=50, M=12, n=10), stats.hypergeom(50, 12, 10), True, [0, 3, 7],
     1e-10),
    ("integeruniform", dict(low=-2, high=7), stats.randint(-2, 8), True, [-2, 3, 7], 1e-14),
    ("largestextremevalue", dict(location=1.0, scale=2.0), stats.gumbel_r(1.0, 2.0), False,
     [-3.0, 1.5, 15.0], 1e-11),
    ("lambda_", dict(lam=0.14), stats.tukeylambda(0.14), False, [-3.0, 0.4, 2.5], 1e-8),
    ("laplace", dict(location=1.0, scale=2.0), stats.laplace(1.0, 2.0), False,
     [-20.0, 1.5, 9.0], 1e-12),
    ("logistic", dict(location=1.0, scale=2.0), stats.logistic(1.0, 2.0), False,
     [-30.0, 1.5, 9.0], 1e-12),
    ("loglogistic", dict(location=0.5, scale=0.4, threshold=1.0),
     stats.fisk(1 / 0.4, 1.0, math.exp(0.5)), False, [1.2, 2.5, 9.0], 1e-11),
    ("lognormal", dict(location=0.5, scale=0.8, threshold=1.0),
     stats.lognorm(0.8, 1.0, math.exp(0.5)), False, [1.3, 2.5, 20.0], 1e-11),
    ("negbinomial", dict(p=0.3, r=3.0), stats.nbinom(3, 0.3, 3), True, [3, 8, 25], 1e-10),
    ("normal", dict(mean=1.0, sigma=2.0), stats.norm(1.0, 2.0), False, [-5.0, 1.5, 12.0],
     1e-12),
    ("poisson", dict(mean=3.5), stats.poisson(3.5), True, [0, 3, 11], 1e-11),
    ("smallestextremevalue", dict(location=1.0, scale=2.0), stats.gumbel_l(1.0, 2.0), False,
     [-8.0, 0.5, 3.0], 1e-11),
    ("t", dict(df=5.5), stats.t(5.5), False, [-4.0, 0.3, 12.0], 1e-11),
    ("triangular", dict(low=1.0, mode=2.0, high=5.0), stats.triang(0.25, 1.0, 4.0), False,
     [1.5, 2.0, 4.0], 1e-13),
    ("uniform", dict(low=-1.0, high=3.0), stats.uniform(-1.0, 4.0), False, [-0.5, 1.0, 2.9],
     1e-14),
    ("weibull", dict(shape=1.7, scale=2.0, threshold=0.5), stats.weibull_min(1.7, 0.5, 2.0),
     False, [0.7, 2.0, 8.0], 1e-11),
    # The noncentral laws (ChiSq, F and T with a noncentrality): SciPy's own
    # series are good to about 1e-9.
    ("chisq", dict(df=4.0, noncentrality=2.5), stats.ncx2(4.0, 2.5), False, [1.0, 6.0, 20.0],
     1e-8),
    ("f", dict(df1=4.0, df2=12.0, noncentrality=3.0), stats.ncf(4.0, 12.0, 3.0), False,
     [0.5, 2.0, 6.0], 1e-7),
    ("t", dict(df=8.0, noncentrality=1.5), stats.nct(8.0, 1.5), False, [-1.0, 1.5, 5.0], 1e-8),
]
PROBABILITIES = [0.03, 0.6]


def t_cdf(t, df):
    """Central t law at 50 digits through the incomplete beta ratio."""
    mpmath.mp.dps = 50
    t, df = mpmath.mpf(t), mpmath.mpf(df)
    half = mpmath.betainc(df / 2, 0.5, 0, df / (df + t * t), regularized=True) / 2
    return half if t < 0 else 1 - half


def t_quantile(p, df):
    """SciPy's t quantile is good to about 1e-9 only; mpmath refines it."""
    start = stats.t.ppf(p, df)
    return float(mpmath.findroot(lambda t: t_cdf(t, df) - mpmath.mpf(p), start))


def rows_of(name, params, law, discrete, points, rtol):
    noncentral = "noncentrality" in params
    out = []
    for x in points:
        if not noncentral:  # the density is the central one
            value = law.pmf(x) if discrete else law.pdf(x)
            out.append([name, "pdf", [x], params, float(value), rtol])
        out.append([name, "cdf", [x], params, float(law.cdf(x)), rtol])
        upper = law.sf(x - 1) if discrete else law.sf(x)
        out.append([name, "cdf", [x], dict(params, upper=True), float(upper), rtol])
    for p in PROBABILITIES:
        central_t = name == "t" and not noncentral
        q = t_quantile(p, params["df"]) if central_t else float(law.ppf(p))
        out.append([name, "inv", [p], params, q, rtol])
    return out


def far_tails():
    """Tails beyond SciPy's reach, from mpmath at 50 digits."""
    mpmath.mp.dps = 50
    ncdf = mpmath.ncdf
    return [
        ["normal", "cdf", [-30.0], {}, float(ncdf(-30)), 1e-13],
        ["normal", "cdf", [37.5], {"upper": True}, float(ncdf(-37.5)), 1e-13],
        ["t", "cdf", [1e6], {"df": 3.0, "upper": True}, float(t_cdf(-1e6, 3)),
         1e-12],
        ["chisq", "cdf", [900.0], {"df": 4.0, "upper": True},
         float(mpmath.gammainc(2, 450, mpmath.inf, regularized=True)), 1e-12],
    ]


def tests_of_statistics():
    """P-values and critical values."""
    norm, t = stats.norm, stats.t
    return [
        ["normal", "pvalue", [2.3], {}, float(2 * norm.sf(2.3)), 1e-12],
        ["normal", "pvalue", [2.3], {"alternative": "less"}, float(norm.cdf(2.3)), 1e-12],
        ["normal", "crit", [0.05], {}, float(norm.isf(0.025)), 1e-12],
        ["t", "pvalue", [2.1], {"df": 12.0}, float(2 * t.sf(2.1, 12)), 1e-11],
        ["t", "crit", [0.05], {"df": 10.0, "k": 3}, t_quantile(1 - 0.05 / 6, 10), 1e-11],
        ["t", "sidak_crit", [0.05], {"df": 10.0, "k": 3},
         t_quantile(1 - (1 - 0.95 ** (1 / 3)) / 2, 10), 1e-10],
        ["chisq", "pvalue", [9.0], {"df": 3.0, "alternative": "greater"},
         float(stats.chi2.sf(9.0, 3)), 1e-11],
        ["f", "pvalue", [3.2], {"df1": 3.0, "df2": 20.0, "alternative": "greater"},
         float(stats.f.sf(3.2, 3, 20)), 1e-11],
        ["studentized_range", "pvalue", [3.5], {"k": 4, "df": 20.0},
         float(stats.studentized_range.sf(3.5, 4, 20)), 1e-6],
    ]


# Samples for the tests (no ties within X, Y, Z).
X = [5.1, 4.9, 5.6, 5.8, 6.0, 5.3, 5.5, 6.2, 4.7]
Y = [4.8, 5.0, 5.2, 5.15, 5.4, 5.05, 4.95, 5.25, 4.85]
Z = [6.1, 6.3, 5.95, 6.4, 5.7]
TABLE = [[12, 5, 9], [7, 14, 6]]
TABLE2 = [[3, 9], [11, 4]]


def statistical_tests():
    """Rows [function, args, kwargs, field, expected, rtol]: field of the
    result of qel.<function>(*args, **kwargs)."""
    rows = []
    r = stats.ttest_1samp(X, 5.0)
    rows += [["one_sample_t", [X], {"mu": 5.0}, "statistic", r.statistic, 1e-12],
             ["one_sample_t", [X], {"mu": 5.0}, "p_value", r.pvalue, 1e-10]]
    ci = r.confidence_interval(0.9)
    rows += [["one_sample_t", [X], {"mu": 5.0, "confidence": 0.9}, "lower_limit", ci.low, 1e-12],
             ["one_sample_t", [X], {"mu": 5.0, "confidence": 0.9}, "upper_limit", ci.high, 1e-12]]
    r = stats.ttest_ind(X, Y, equal_var=True, alternative="greater")
    rows += [["two_sample_t", [X, Y], {"pooled": True, "alternative": "greater"}, "p_value",
              r.pvalue, 1e-10]]
    r = stats.ttest_rel(X, Y)
    rows += [["paired_t", [X, Y], {}, "statistic", r.statistic, 1e-12],
             ["paired_t", [X, Y], {}, "p_value", r.pvalue, 1e-10]]
    r = stats.mannwhitneyu(X, Y, use_continuity=True, method="asymptotic")
    rows += [["mann_whitney", [X, Y], {}, "p_value", r.pvalue, 1e-10]]
    r = stats.kruskal(X, Y, Z)
    rows += [["kruskal_wallis", [[X, Y, Z]], {}, "statistic", r.statistic, 1e-12],
             ["kruskal_wallis", [[X, Y, Z]], {}, "p_value", r.pvalue, 1e-10]]
    chi2, p, df, expected = stats.chi2_contingency(TABLE, correction=False)
    rows += [["contingency_table", [TABLE], {}, "chisq", chi2, 1e-12],
             ["contingency_table", [TABLE], {}, "chisq_p_value", p, 1e-10],
             ["contingency_table", [TABLE], {}, "expected", expected.tolist(), 1e-12]]
    g, p, _, _ = stats.chi2_contingency(TABLE, correction=False, lambda_="log-likelihood")
    rows += [["contingency_table", [TABLE], {}, "lr", g, 1e-12]]
    rows += [["contingency_table", [TABLE2], {}, "fisher_p_value",
              stats.fisher_exact(TABLE2)[1], 1e-10]]
    r = stats.chisquare([18, 22, 60], [20, 30, 50])
    rows += [["chisq_gof", [[18, 22, 60], [0.2, 0.3, 0.5]], {}, "p_value", r.pvalue, 1e-10]]
    ci = stats.binomtest(7, 30).proportion_ci(0.95, method="exact")
    rows += [["one_proportion", [7, 30], {}, "lower_limit", ci.low, 1e-10],
             ["one_proportion", [7, 30], {}, "upper_limit", ci.high, 1e-10]]
    q = t_quantile(0.975, 5.0)
    rows += [["symmetric_interval", [10.0, 2.0], {"df": 5.0}, None,
              [10.0 - 2.0 * q, 10.0 + 2.0 * q], 1e-12],
             ["one_sample_z_summary", [5.2, 25], {"mu": 5.0}, "p_value",
              2 * stats.norm.sf(1.0), 1e-12]]
    f_p = stats.f.cdf((2.0 / 3.0), 9, 11)
    rows += [["two_variances_summary", [2.0, 10, 3.0, 12], {}, "f_p_value",
              2 * min(f_p, 1 - f_p), 1e-10]]
    rows += [["pearson", [X, Y], {}, None, stats.pearsonr(X, Y)[0], 1e-12],
             ["spearman", [X, Y], {}, None, stats.spearmanr(X, Y)[0], 1e-12]]
    return [[f, a, k, field, v, tol] for f, a, k, field, v, tol in
            ((f, a, k, field, float(v) if not isinstance(v, list) else v, tol)
             for f, a, k, field, v, tol in rows)]


def main():
    rows = []
    for family in FAMILIES:
        rows += rows_of(*family)
    rows += far_tails() + tests_of_statistics()
    path = os.path.join(ROOT, "tests", "data", "python_distributions.json")
    write(path, rows)
    path = os.path.join(ROOT, "tests", "data", "python_tests.json")
    write(path, statistical_tests())


def write(path, rows):
    """One row a line."""
    with open(path, "w") as out:
        out.write("[\n" + ",\n".join(json.dumps(r) for r in rows) + "\n]\n")
    print(f"wrote {len(rows)} rows to {os.path.relpath(path, ROOT)}")


if __name__ == "__main__":
    main()
