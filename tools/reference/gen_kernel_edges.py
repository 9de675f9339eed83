"""Edge cases of the distribution kernels, one call per row.

Writes tests/data/kernel_edges.csv in the layout of kernels.csv
(family,function,x,param1..param4,expected): the ends of the support, the
thresholds, the integer rules of the discrete laws, the catches where a
formula would overflow, and the quantiles at p = 0 and 1. The expected
values are limits of the definitions (0, 1, a support end) or exact values
evaluated here with mpmath; "nan" stands for the missing value. Run with
/usr/bin/python3 from the repository root.
"""
import os

from mpmath import mp, mpf, exp, binomial

from refdata import write_rows

mp.dps = 40
OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")
MISSING = "nan"
rows = []


def case(family, function, x, params, expected):
    p = [repr(float(v)) for v in params] + ["0.0"] * (4 - len(params))
    rows.append([family, function, repr(float(x))] + p + [expected if isinstance(expected, str) else mpf(expected)])


# Catches: exp(-z) overflows far from the location; log(0) at the ends.
case("lev", "lower", -1e5, (0, 1), 0)
case("lev", "upper", -1e5, (0, 1), 1)
case("lev", "pdf", -1e5, (0, 1), 0)
case("sev", "upper", 1e5, (0, 1), 0)
case("sev", "lower", 1e5, (0, 1), 1)
for family in ("lev", "sev"):
    for p in (0, 1):
        case(family, "inv", p, (0, 1), MISSING)
case("exponential", "inv", 1, (2, 0), MISSING)
case("weibull", "inv", 1, (2, 3, 0), MISSING)
case("weibull", "inv", 0, (2, 3, 1.5), 1.5)
case("laplace", "inv", 0, (1, 2), MISSING)
case("laplace", "inv", 1, (1, 2), MISSING)
case("laplace", "inv", 0.5, (1, 2), 1)
case("exponential", "pdf", 1000, (-1, 0), MISSING)  # negative scale: the exponent overflows
case("normal", "pdf", 1e200, (0, 1e-200), 0)
# Thresholds and support.
case("exponential", "lower", 1, (2, 1), 0)
case("exponential", "upper", 1, (2, 1), 1)
case("exponential", "pdf", 0.5, (2, 1), 0)
case("exponential", "pdf", 1, (2, 1), 0.5)
case("weibull", "pdf", 1, (2, 3, 1), 0)
case("weibull", "upper", 1, (2, 3, 1), 1)
case("lognormal", "upper", 2, (0, 1, 2), 1)
case("lognormal", "pdf", 2, (0, 1, 2), 0)
case("lognormal", "inv", 0, (0, 1, 2), 2)
case("halfnormal", "lower", 3, (2, 3), 0)  # (x, scale, location)
case("halfnormal", "upper", 3, (2, 3), 1)
case("halfnormal", "lower", 2, (2, 3), 0)
case("halfnormal", "pdf", 2, (2, 3), 0)
case("gamma", "upper", 0.5, (2, 1, 1), 1)
case("gamma", "pdf", 1, (2, 1, 1), 0)
case("chisq", "upper", 0, (3, 0), 1)
case("chisq", "pdf", -1, (3,), 0)
# Quantiles at the ends; a gamma quantile of 0 is 0 without the threshold,
# also where it lies below the smallest normal double (e^-2303 here); one
# of 5.6e-301 is a normal double and keeps the threshold.
case("gamma", "inv", 0, (2, 3, 5), 0)
case("gamma", "inv", 1e-10, (0.01, 1, 7), 0)
case("gamma", "inv", 0.001, (0.01, 1, 7), 7)
case("chisq", "inv", 0, (4, 0), 0)
case("chisq", "inv", 1, (4, 0), MISSING)
case("chisq", "inv", 1, (4, 2), MISSING)
# A subnormal probability still has its quantile (about -38.27).
z_tiny = mp.findroot(lambda z: mp.ncdf(z) / mpf(1e-320) - 1, -38.3)
case("normal", "inv", 1e-320, (0, 1), z_tiny)
case("lognormal", "inv", 1e-320, (0, 1, 0), exp(z_tiny))
case("chisq", "lower", 1, (-3, 0), MISSING)  # a failed ELV call
case("gamma", "lower", 1, (-2, 1, 0), MISSING)
# Tukey lambda: lambda > 0 ends at -+1/lambda; a negative lambda refuses p = 0.
case("lambda", "lower", -0.6, (2, 0, 1), 0)
case("lambda", "lower", 0.6, (2, 0, 1), 1)
case("lambda", "upper", 0.6, (2, 0, 1), 0)
case("lambda", "pdf", 0.6, (2, 0, 1), 0)
case("lambda", "inv", 0.75, (1, 0, 1), 0.5)
case("lambda", "inv", 0.75, (2, 0, 1), 0.25)
case("lambda", "inv", 0, (-0.5, 0, 1), MISSING)
# A negative lambda: the support is the real line, P(X <= x) the root p of
# Q(p) = (p^l - (1 - p)^l)/l = x.
case("lambda", "lower", 0.3, (-0.5, 0, 1),
     mp.findroot(lambda p: (p**mpf(-0.5) - (1 - p)**mpf(-0.5)) / mpf(-0.5) - mpf(0.3), 0.55))
# Integer rules: a mass only at integers (within 1e-12), tails of the floor.
case("binomial", "pdf", 2.5, (5, 0.5), 0)
case("binomial", "pdf", 2.0 + 1e-13, (5, 0.5), mpf(10) / 32)
case("binomial", "upper", 2, (5, 0.5), mpf(26) / 32)  # the upper tail includes the point
case("binomial", "lower", 2, (5, 0.5), mpf(16) / 32)
case("binomial", "lower", 2.7, (5, 0.5), mpf(16) / 32)
case("binomial", "lower", -1, (5, 0.5), 0)
case("binomial", "lower", 5, (5, 0.5), 1)
case("binomial", "pdf", 0, (5, 0), 1)
case("binomial", "pdf", 5, (5, 1), 1)
case("binomial", "pdf", 4, (5, 1), 0)
case("binomial", "pdf", 6, (5, 0.3), 0)
case("poisson", "upper", 0, (3,), 1)
case("poisson", "lower", -0.5, (3,), 0)
case("poisson", "pdf", -1, (3,), 0)
case("poisson", "pdf", 1.5, (3,), 0)
case("poisson", "lower", 2, (0,), 1)
case("poisson", "upper", 2, (0,), 0)
case("poisson", "lower", 2.9, (3,), exp(-3) * (1 + 3 + mpf(9) / 2))
case("negbinomial", "pdf", 2, (0.5, 3), 0)
case("negbinomial", "pdf", 4, (0.5, 2.5), 0)  # r - 1 not an integer
case("negbinomial", "pdf", 3, (0.5, 3), mpf(1) / 8)
case("negbinomial", "lower", 2, (0.5, 3), 0)
case("negbinomial", "upper", 3, (0.5, 3), 1)
case("geometric", "pdf", 3, (0.25,), mpf(1) / 4 * (mpf(3) / 4) ** 2)
case("geometric", "upper", 3, (0.25,), (mpf(3) / 4) ** 2)
case("hypergeometric", "pdf", 6, (20, 7, 5), 0)
case("hypergeometric", "upper", -1, (20, 7, 5), 1)
case("hypergeometric", "lower", 6, (20, 7, 5), 1)
case("hypergeometric", "upper", 6, (20, 7, 5), 0)
case("intuniform", "lower", 3.5, (1, 6), mpf(1) / 2)
case("intuniform", "upper", 3.5, (1, 6), mpf(1) / 2)
case("intuniform", "upper", 3, (1, 6), mpf(4) / 6)
case("intuniform", "lower", 0, (1, 6), 0)
case("intuniform", "lower", 6, (1, 6), 1)
case("intuniform", "pdf", 2, (1, 6), mpf(1) / 6)
case("intuniform", "pdf", 2.5, (1, 6), 0)
case("intuniform", "pdf", 7, (1, 6), 0)
# Discrete quantiles at the ends and on degenerate parameters.
case("poisson", "inv", 0, (3,), 0)
case("poisson", "inv", 1, (3,), MISSING)
case("negbinomial", "inv", 0.1, (0.5, 3), 3)  # p <= prob^r
case("negbinomial", "inv", 1, (0.5, 3), MISSING)
case("negbinomial", "inv", 0.5, (0, 3), MISSING)
for p, params, k in [(0.3, (10, 10, 4), 4), (0.3, (10, 0, 4), 0), (0.3, (10, 6, 10), 6),
                     (0.3, (10, 6, 0), 0), (0, (10, 6, 7), 3), (1, (10, 6, 7), 6)]:
    case("hypergeometric", "inv", p, params, k)
case("intuniform", "inv", 0, (1, 6), 1)
case("intuniform", "inv", 1, (1, 6), 6)
case("binomial", "inv", 0, (12, 0.3), 0)
case("binomial", "inv", 1, (12, 0.3), 12)
# t, F and beta: the noncentrality limit, the ends of (0, 1).
case("t", "lower", 1, (10, 1e5), 0)  # a second try just inside the limit
case("t", "upper", 1, (10, 1e5), 1)
case("t", "lower", 1e6, (10, 1e5), MISSING)
case("t", "inv", 0, (4, 1), MISSING)
case("t", "inv", 1, (4, 0), MISSING)
case("f", "inv", 0, (3, 8, 2), 0)
case("f", "inv", 1, (3, 8, 2), MISSING)
for x, a, b, value in [(0, 0.5, 2, MISSING), (0, 1, 2.5, 2.5), (0, 3, 2.5, 0), (1, 2, 0.5, MISSING),
                       (1, 4, 1, 4), (1, 4, 2, 0), (1.5, 4, 2, 0)]:
    case("beta", "pdf", x, (a, b), value)
case("beta", "upper", 0, (2, 3), 1)
case("beta", "upper", 1, (2, 3), 0)
case("beta", "lower", 1, (2, 3), 1)
case("beta", "inv", 0, (2, 3), 0)
case("beta", "inv", 1, (2, 3), 1)

write_rows(os.path.join(OUT, "kernel_edges.csv"),
           "family,function,x,param1,param2,param3,param4,expected", rows)
