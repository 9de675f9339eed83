"""Edge and branch cases of the ELV routines, one call per row.

Writes tests/data/elv_cases.csv. Arguments are chosen by hand on the edges of
the admissible ranges and inside each branch; the expectations are the
documented ones (status, branch number, routine name, the failure output
-DBL_MAX, untouched outputs -7, exact 0 and 1 of a limit) or values of the
mathematics evaluated here with mpmath (point masses, linear forms, limits).
Run with /usr/bin/python3 from the repository root.

Columns: call,a1,a2,a3,a4,status,method,routine,out1,out2,out3,steps1,steps2,tol
'*' leaves a field unchecked; 'ok' is status 0 or 1; 'lo..hi' a range of a
counter; tol is the relative tolerance of the outputs (default 1e-14).
"""
import os

import mpmath
from mpmath import mp

from refdata import d, fmt, write_rows

mp.dps = 40
OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")
HUGE = "-1.7976931348623157e308"  # the failure output of a quantile
NAN = "nan"
rows = []


def case(call, args, status="*", method="*", routine="*", out=(), steps=(), tol="*"):
    a = [x if isinstance(x, str) else repr(float(x)) for x in args] + ["0"] * (4 - len(args))
    o = [x if isinstance(x, str) else fmt(x) for x in out] + ["*"] * (3 - len(out))
    s = [str(x) for x in steps] + ["*"] * (2 - len(steps))
    rows.append([call] + a + [str(status), str(method), routine] + o + s + [str(tol)])


def sqrt_half_pi_times(p):
    """The linear centre of the normal quantile, sqrt(pi/2)(1 - 2p)."""
    return mpmath.sqrt(mp.pi / 2) * (1 - 2 * d(p))


# Beta: refused arguments leave the outputs; the ends of (0, 1); vanishing
# shapes put all mass at the two ends in the ratio b : a.
for args in [(-0.1, 2, 3), (1.1, 2, 3), (0.5, -1, 3), (0.5, 2, 94906266.0), (NAN, 2, 3), (0.5, 2, NAN)]:
    case("beta_df", args, 2, routine="beta_df", out=["-7"])
case("beta_df", (0, 2, 3), 0, out=[0, 1, -1])
case("beta_df", (1, 2, 3), 0, out=[1, 0, -1])
for x in (1e-100, 0.2, 0.9):
    case("beta_df", (x, 1e-13, 3e-13), 1, out=[mpmath.mpf(3) / 4, mpmath.mpf(1) / 4])
case("beta_df", (0.3, 1e-13, 1e-13), 1, out=[mpmath.mpf(1) / 2])
# Branches: x = 1/2 is not exchanged; just above it is.
case("beta_df", (0.5, 2, 5), method=60)
case("beta_df", ("0.50000000000000011", 5, 2), method=60)
case("beta_df", (0.5, 5, 2), method=10)
case("beta_df", (0.1, 2, 3), method=10, steps=[3])
case("beta_df", (0.02, 0.5, 20), method=50)
case("beta_df", (0.2, 0.5, 20), method=61, steps=["*", "1..100000"])
case("beta_df", (0.3, 2.5, 20), method=61)
case("beta_df", (1e-200, 5, 5), 1, out=[0, 1])
case("beta_df", ("0.999999999999", 5, 400), 1, out=[1, 0])
# Scaled series count their terms.
case("beta_Iabx", (2, 4, 0.2), 0, steps=[4])
case("beta_Iabx", (2, 4.5, 0.45), 0, steps=["*", "1..100000"])
case("beta_Jabx", (3, 2, 0.7), 0, method=0, steps=[3])
case("beta_J_complete", (0.5, 0.5, 0.2), 0, method=2, steps=["*", 12])
case("beta_J_complete", (0.5, 10, 0.3), 0, method=1)
# Noncentral beta.
case("beta_ncdf", (0.3, 2, 3, -1), 2, routine="beta_ncdf")
case("beta_ncdf2", (1.3, 2, 3, 1), 2, routine="beta_ncdf2")
case("beta_ncdf", (0.3, 94906000.0, 3, 1000), 3, out=["-7"])
case("beta_ncdf", (0, 2, 3, 5), 0, out=[0, 1])
case("beta_ncdf2", (0, 2, 3, 5), method=1000)
case("beta_ncdf", (0.2, 2, 8, 50), method=13, steps=["51..100000"])
case("beta_ncdf", (1e-100, 20, 8, 50), 1, method=12, out=[0])
case("beta_ncdf", (0.5, 2, 3, 4), 0, method="0..999", routine="beta_ncdf")
case("beta_ncdf2", (0.5, 3, 2, 4), 0, method="0..999", routine="beta_ncdf")
case("beta_ncdf", (0.8, 2, 3, 4), 0, method="1000..100000", routine="beta_ncdf2")

# Binomial: ranges, the trivial cases, the branches either side of the mode.
case("binomial_df", (11, 10, 0.3), 2, method=100)
case("binomial_df", (3, 94906266, 0.3), 2)
case("binomial_df", (3, 10, 1.5), 2)
case("binomial_df", (0, 0, 0.3), method=1, out=["*", "*", 1])
case("binomial_df", (2, 10, 0), method=2, out=[1, "*", 0])
case("binomial_df", (9, 10, 1), method=3, out=[0, 1])
for prob in (0.2, 0.9):
    case("binomial_df", (10, 10, prob), method=4, out=[1, 0, d(prob) ** 10])
for k, prob, method in [(1, 0.3, 110), (5, 0.3, 120), (5, 0.7, 220), (8, 0.7, 210)]:
    case("binomial_df", (k, 10, prob), method=method)
case("binomial_df", (2, 100, 0.5), method=110)
case("binomial_df", (2, 1000, 0.5), 1, method=111)
case("binomial_df", (0, 90000000, 0.5), 1, out=[0, 1])
case("binomial_lower_quant", (10, 0.7, 0.3), 2, out=[94906265])
case("binomial_upper_quant", (0, 0.1, 0.3), 2, routine="binomial_upper_quant")
case("binomial_upper_quant", (10, 0.1, 0), method=1, out=[0, 0.1])
case("binomial_lower_quant", (10, 0.1, 1), method=2, out=[10])
case("binomial_upper_quant", (200, 0.05, 0.3), 0, method=4)

# Beta and F quantiles, F tails.
case("beta_lower_quant", (0.6, 2, 3), 2, out=[HUGE])
case("beta_upper_quant", (1e-13, 2, 3), 2, routine="beta_upper_quant")
case("beta_lower_quant", (0.1, 0.0009, 3), 2)
case("beta_lower_quant", (0.1, 2, 94906265.0), 2)
case("F_upper_quant", (0.1, 0.001, 3), 2, routine="F_upper_qt", out=[HUGE])
case("F_lower_quant", (0.1, 3, 2e8), 2, routine="F_upper_qt")
case("F_lower_quant", (0.1, 3, 7), 0, routine="F_upper_qt")
case("F_df", (-1, 3, 4), 2, routine="F_df")
case("F_ncdf", (1, 3, 2e8, 1), 2)
case("F_ncdf", (1, 3, 4, -1), 2, out=["-7"])
case("F_df", (2, 0, 4), "ok")
case("F_df", (0, 0, 0), "ok")

# Gamma: refused arguments, 0 and huge arguments, one point per branch.
for x, a in [(1, 0), (-1, 2), (1, 94906265.5), (NAN, 1), (1, NAN)]:
    case("gamma_df", (x, a), 2, method=0, routine="gamma_df", out=["-7", "-7", "-7"])
case("gamma_df", (94906265.0, 94906265.0), 0)
case("gamma_df", (0, 3), 0, method=1, out=[0, 1, "-7"])
case("gamma_df", (1e-290, 0.001), method=1, out=[0])
case("gamma_df", (189812531.0, 5), method=2, out=[1, 0, 0])
for x, a, method, status in [(0.5, 1, 10, 0), (1, 1000, 20, 1), ("89657050.987754732", 9e7, 40, 0),
                             (0.5, 0.3, 50, 0), (200, 10.5, 60, 0), (3, 1, 61, 0), (0.9, 1.2, 62, 0),
                             (800, 0.5, 70, 1), (2000, 10, 80, 1), ("90343423.353894278", 9e7, 100, 0)]:
    case("gamma_df", (x, a), status, method=method)
case("gamma_df", (50, 100), 0, steps=["11..999"])
case("gamma_ncdf", (1, -1, 1), 2)
case("gamma_ncdf", (1, 1, -1), 2)
case("gamma_ncdf", (NAN, 1, 1), 2, routine="gamma_ncdf")
# a + L + 6.1738 sqrt(L) beyond the largest shape 94906265: code 3.
case("gamma_ncdf", (1e8, 1, "94846218.93514274"), 3)
case("gamma_ncdf", (94000000.0, 1, 94000000.0), 0)
case("gamma_ncdf", (0, 2.5, 4), method=1, steps=[0])
case("gamma_ncdf", (2e8, 2.5, 4), method=2, out=[1, 0])
case("gamma_ncdf", (110, 100, 10), method=13)
case("gamma_ncdf", (111, 100, 10), method=24)
case("gamma_ncdf", (0.02, 0.01, 0.01), method=124, out=["0.9..1"])
case("gamma_ncdf", (1e-3, 100, 1e4), 1, method=12, out=[0, 1])
case("gamma_ncdf", (1e5, 100, 1e4), 1, method=23, out=["*", 0])
case("chi2_df", (1, 189812531.0), 2)
case("chi2_df", (-1, 2), 2)
case("chi2_df", (0, 3), out=[0, "*", "-7"])
# chi2_ncdf's width test takes L itself, gamma_ncdf's L/2.
case("chi2_ncdf", (1e8, 2, 9.49e7), 3)
case("gamma_ncdf", (4.745e7, 1, 4.745e7), 0)
# chi2_df admits 0 degrees of freedom, the gamma law underneath does not:
# the inner failure stands through the outer routine's normal exit.
case("chi2_df", (1, 0), 2, routine="gamma_df", out=["*", "*", "-7"])

# Poisson.
case("poisson_df", (3, -1), 2)
case("poisson_df", (94906266, 10), 2)
case("poisson_df", (1e19, 10), 2)  # beyond the signed range of the routine
case("poisson_df", (94906265, 94906265.0), 0)
case("poisson_df", (0, 0), method=1, out=[1, 0, 1], steps=[0])
case("poisson_df", (4, 0), out=["*", "*", 0])
for k, m, method, status in [(5, 10, 10, 0), (0, 800, 11, 1), (89657417, 9e7, 13, 0),
                             (20, 10, 20, 0), (3000, 1000, 21, 1), (90342982, 9e7, 23, 0)]:
    case("poisson_df", (k, m), status, method=method)
case("poisson_upper_quant", (0.6, 3), 2)
case("poisson_lower_quant", (1e-13, 3), 2)
case("poisson_lower_quant", (0.1, 94906266.0), 2)
# A mean of 36 starts at 0 and reaches the median 36 in 36 steps.
case("poisson_lower_quant", (0.5, 36), 0, out=[36], steps=[36])

# Gamma and chi-square quantiles.
for p, a in [(0.6, 2), (1e-13, 2), (0.1, 0), (0.1, 94906265.0), (NAN, 2)]:
    case("gamma_upper_quant", (p, a), 2, out=[HUGE])
    case("gamma_lower_quant", (p, a), 2, out=[HUGE])
    case("chi2_lower_quant", (p, 2 * float(a)), 2, out=[HUGE])
for form, p, a, method, status in [
        ("upper", 0.1, 1e-15, 0, 1), ("upper", 1e-3, 0.5, 1, 0), ("upper", 0.5, 0.01, 3, 0),
        ("upper", 0.3, 0.1, 4, 0), ("upper", 1e-3, 1e5, 5, 0), ("upper", 1e-3, 50, 6, 0),
        ("lower", 0.5, 0.001, 0, 1), ("lower", 1e-12, 0.002, 1, 1), ("lower", 0.01, 0.01, 2, 0),
        ("lower", 0.1, 0.5, 3, 0), ("lower", 0.1, 5, 4, 0), ("lower", 0.1, 1e5, 5, 0),
        ("lower", 1e-12, 10.5, 6, 0)]:
    case("gamma_%s_quant" % form, (p, a), status, method=method, out=[0] if status == 1 else [])

# Normal: far tails, the quantile ranges, the linear centre, AS 111.
case("normal_df", (38,), 0, routine="normal_df", out=[1, 0])
case("normal_df", (-38,), 0, out=[0, 1])
case("normal_upper_quant", (0.6,), 2, out=[HUGE])
case("normal_upper_quant", (1e-101,), 2)
case("normal_upper_quant", (0.5000001,), 2, out=[HUGE])
case("normal_lower_quant", (0.6,), 2, routine="normal_lower_quant")
case("normal_lower_quant", (2,), 2, routine="normal_lower_quant")
case("inv_normal_df", (1,), 2, out=[HUGE])
case("inv_normal_df", (0.5e-100,), 2, routine="inv_normal_df")
case("inv_normal_df", (0.5,), 0, out=[0])
for p in (0.4999999, 0.4999975):
    case("normal_upper_quant", (p,), 0, out=[sqrt_half_pi_times(p)])
# The starting value: AS 111 is good to about 1e-7 in the body.
for p, tol in [(0.975, 1e-6), (0.025, 1e-6), (1e-10, 2e-3)]:
    case("inv_normal_df0", (p,), out=[-mpmath.sqrt(2) * mpmath.erfinv(1 - 2 * d(p))], tol=tol)
case("inv_normal_df0", (0,), out=[HUGE])
case("inv_normal_df0", (1,), out=[HUGE])

# Central and noncentral t.
case("t_upper_quant", (0.6, 3), 2, out=[HUGE])
case("t_lower_quant", (0.1, 0.001), 2, routine="t_lower_qt")
case("t_upper_quant", (1e-13, 3), 2, routine="t_upper_qt")
case("t_upper_quant", (0.5, 7), 0, out=[0])
case("t_ncdf", (0, 7, 1), 0, method=3, out=[mpmath.ncdf(-1)], tol=1e-9)
case("t_ncdf", (-1, 10, 22), 0, method=1, out=[0, 1])
case("t_ncdf", (-1, 10, 21.3), "ok", method="2..100000", out=["1e-300..1e-100"])
case("t_ncdf", (-3, 1000, 2), "ok", method=2001)
case("t_ncdf", (1, 0, 1), 2)
case("t_ncdf", (1, 2e8, 1), 2)
case("t_ncdf", (1, 10, 14000), 3)
case("t_ncdf", (-1e150, 3, 1), 0, out=[0, 1])
# The region edges of the far-tail methods 3000 (m <= 6, t <= -10) and
# 3001 (m >= 7, t < -25).
case("t_ncdf", (-10, 3, 15), 1, method=3000)
case("t_ncdf", (-9.999, 3, 15), "ok", method=4001)
case("t_ncdf", (-25, 9, 15), "ok", method=3)
case("t_ncdf", (-25.001, 9, 15), 1, method=3001)
# The far-tail expansion: any m outside 1..12, NaN or |delta| >= 1e6 gives -1.
for args in [(-30, 0.999, 1), (-30, 13, 1), (-30, 40, 1), (-30, -2, 1), (-30, NAN, 1), (NAN, 3, 1),
             (-30, 3, NAN), (-30, 3, 1e6), (-30, 3, -2e6)]:
    case("t_expansion_approx", args, 4, routine="t_ncdf", out=[-1])
case("t_expansion_approx", ("-inf", 4, 2), 0, out=[0])
case("t_expansion_approx", (-1e200, 4, 2), 0, out=[0])
case("t_expansion_approx", (-40, 12.999, 1), 0, out=["-0.5..1"])  # not the failure value -1
# The closed saddle form: -1 outside its arguments, 0 where the boundary
# lies on the near side of the mode or the tail underflows; the step
# counters are cleared.
for args in [(NAN, 10, 1), (-1, 0, 1), (-1, 2e8, 1), (-1, 10, 1e6), (-1, NAN, 1), ("-inf", 10, 1)]:
    case("t_saddle_approx", args, out=[-1])
for args in [(2, 50, 0.5), (-0.5, 50, -3), (-200, 1e6, 12), (-1e150, 10, 1)]:
    case("t_saddle_approx", args, out=[0])
case("t_saddle_approx", (-20, 100, 21), out=["1e-287..1e-100"])
case("t_saddle_approx", (-1e-80, 10, 1e-80), out=["0.45..0.55"])
case("t_saddle_approx", (-3, 100, 2), steps=[0, 0])

# Complementary Owen's T: refusals, term counts, limits of the integral.
for h, a in [(1, 0), (1, -2), (NAN, 1), (1, NAN)]:
    case("Tha_c", (h, a), 4, out=[-1])
for h, a, steps in [(0, 2, "20..28"), (0, 1.3334, "50..70"), (1, 0.1, "6..10"), (2, 1, 0)]:
    case("Tha_c", (h, a), 0, steps=[steps])
case("Tha_c", (1e300, 0.5), 0, out=[0])
case("Tha_c", (-1e300, 0.5), 0, out=[mpmath.mpf(1) / 2], tol=1e-16)
case("Tha_c", (1, 1e-300), 0, out=[mpmath.ncdf(-1) / 2], tol=1e-15)
case("Tha_c", (0, 1e200), 0, out=[1 / (2 * mp.pi * d(1e200))], tol=1e-15)

# Hypergeometric: invalid and trivial cases, quantile ranges.
for args in [(0, 1, 0, 0), (3, 10, 2, 4), (0, 10, 2, 9), (0, 94906266, 2, 9)]:
    case("hypergeo_df", args, 2)
case("hypergeo_df", (0, 12345, 17, 0), 0, method=1, out=[1, 0, 1])
case("hypergeo_df", (7, 20, 7, 20), method=2, out=["*", "*", 1])
case("hypergeo_df", (0, 20, 0, 5), method=3)
case("hypergeo_df", (5, 20, 20, 5), method=4, steps=[0])
case("hypergeo_df", (4, 10, 4, 4), 0, method=106, out=[1, 0, mpmath.mpf(1) / 210])
case("hypergeo_df", (2, 20, 10, 10), method="100..199")
case("hypergeo_df", (1900, 90000000, 45000000, 2000), 1, out=[1, 0])
for k, N, M, n, method in [(3, 50, 10, 12, 100), (9, 50, 40, 12, 200), (7, 50, 10, 38, 300),
                           (31, 50, 38, 40, 400)]:
    case("hypergeo_df", (k, N, M, n), 0, method="%d..%d" % (method, method + 99))
case("hypergeo_lower_quant", (0.1, 20, 20, 5), 2, out=[94906265])
case("hypergeo_upper_quant", (0.6, 20, 5, 5), 2)
case("hypergeo_upper_quant", (1e-13, 20, 5, 5), 2)
case("hypergeo_lower_quant", (0.1, 1, 0, 0), 2)

write_rows(os.path.join(OUT, "elv_cases.csv"),
           "call,a1,a2,a3,a4,status,method,routine,out1,out2,out3,steps1,steps2,tol", rows)
