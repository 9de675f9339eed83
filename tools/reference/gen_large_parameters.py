#!/usr/bin/env python3
"""Distribution functions at large parameters: shapes, degrees of freedom,
means, counts and r from 1e6 to 1e300, at the centre of the law and at -/+3
and -/+30 standard deviations, and quantiles at p from 1e-300 to 1 - 1e-10.

Method. mpmath's own gammainc and betainc sum series whose length grows with
the shape and give up near 1e10, so every tail here is a quadrature of the
density in the standardised variable s = (t - mean) / sd:

    tail = integral of g(s) ds,  g(s) = sd * density(mean + sd * s),

where the density is evaluated from its closed form (log-gamma and log-beta
normalisers included) at a working precision of 60 digits plus the decimal
exponent of the largest parameter, so that the cancellation between terms
of size a*ln(a) leaves 60 digits, and the quadrature itself (Gauss-Legendre
with 40 points) runs at 45 digits over pieces of width 1/(1 + |s|) doubling to 4 in s. Only the
smaller tail is integrated, out to 45 standard deviations beyond the point
or the centre (the density is below e^-1000 relative to the tail there);
the other tail is 1 minus it. A self-check at the end compares the
quadrature with mpmath's gammainc and betainc at shapes 400 to 3e4, where
those converge, and requires agreement to 1e-25.

The discrete laws are tails of the continuous ones at integer points:
Poisson P(X <= k) = Q(k + 1, mean); Binomial P(X <= k) = I_{1-p}(n - k,
k + 1); NegBinomial (trials up to the r-th success) P(X <= x) = I_p(r,
x - r + 1); Geometric in closed form. Noncentral laws: the noncentral t as
the integral over the chi-square of Phi(t sqrt(v/df) - delta); noncentral
chi-square and F as Poisson mixtures of gamma and beta tails, with the
terms chained by the exact recurrences P(a+1, x) = P(a, x) - x^a e^-x /
Gamma(a+1) and I_y(a+1, b) = I_y(a, b) - y^a (1-y)^b / (a B(a, b)).

Quantiles are solved in mpmath to 40 digits (the secant method on the
smaller tail); a discrete quantile is the smallest integer k with
P(X <= k) >= p, written as the smallest double >= k (beyond 2^53 every
double is an integer).

Each row carries a condition number. Tails: |x f(x) / F(x)|, the relative
change of the tail that one rounding of x causes, written only where
neighbouring doubles of x are more than a standard deviation apart (there
the double inputs do not determine the tail to 1e-12) or where x is divided
by a scale other than 1, or enters the F law through y = m x / (m x + n)
(a rounding every method makes); elsewhere 0.
Densities: |s| |mean| / sd + 1, s the standardised distance, the change of
the density that a rounding of x, of the mean or of 1 - p causes (as the
condition column of extreme_shapes.csv).

Writes tests/data/large_parameters.csv with rows
    family,function,x,param1,param2,param3,expected,condition
function: pdf, lower, upper or inv (x is then p). expected is 0 below
1e-300.
Run: /usr/bin/python3 tools/reference/gen_large_parameters.py
"""
import math
import os
import sys

import mpmath
from mpmath import mp, mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import write_rows  # noqa: E402

DATA = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data")
BIG = [1e6, 1e8, 1e10, 1e15, 1e20, 1e30, 1e100, 1e300]
STEPS = [0, -3, 3, -30, 30]
PROBS = [1e-300, 1e-10, 0.3, 0.5, 0.9, 1 - 1e-10]
QUAD_DPS = 45
mp.dps = QUAD_DPS


def d(x):
    return mpf(float(x))


def hp_digits(*params):
    """Working digits for densities: 60 beyond the size of a*ln(a)."""
    big = max([abs(float(p)) for p in params] + [10.0])
    return 60 + int(math.log10(big)) + 5


# --- Quadrature of a standardised density ------------------------------------

_GL = None


def integrate(f, pts):
    """Gauss-Legendre, 40 points on each piece between consecutive pts (the
    tanh-sinh default of mpmath.quad stalls near 1e-11 on these pieces)."""
    global _GL
    if _GL is None:
        _GL = mpmath.gauss_quadrature(40, "legendre")
    total = []
    for a, b in zip(pts[:-1], pts[1:]):
        h, c = (b - a) / 2, (a + b) / 2
        total.append(h * mpmath.fsum(w * f(c + h * x) for x, w in zip(*_GL)))
    return mpmath.fsum(total)



def smaller_tail(logg, s0, lo, hi):
    """(lower, upper) of the law with log density logg(s) in s, cut at s0, on
    the support (lo, hi) in s. The smaller tail by quadrature; the other as
    its complement."""
    def g(s):
        v = logg(s)
        return mpmath.exp(v) if v > -3000 else mpf(0)

    def pieces(a, b):
        # Points from a towards b at widths h, h, 2h, 4h, ... up to 4, where
        # 1/h is the decay rate of the density near s0.
        pts = [a]
        step = 1 / (1 + abs(mpf(a)))
        sign = 1 if b > a else -1
        while abs(b - pts[-1]) > step:
            pts.append(pts[-1] + sign * step)
            step = min(step * 2, 4)
        pts.append(b)
        return pts

    if s0 >= 0:
        end = min(hi, s0 + 45)
        if end <= s0:
            return mpf(1), mpf(0)
        up = integrate(g, pieces(s0, end))
        return 1 - up, up
    end = max(lo, s0 - 45)
    if end >= s0:
        return mpf(0), mpf(1)
    low = integrate(g, pieces(s0, end))
    return -low if low < 0 else low, 1 - abs(low)


def clean(lo_up):
    return tuple(abs(v) for v in lo_up)


# --- Gamma --------------------------------------------------------------------

_lgamma = {}


def lgamma_hp(a):
    key = (a, mp.dps)
    if key not in _lgamma:
        _lgamma[key] = mpmath.loggamma(a)
    return _lgamma[key]


def gamma_tails(a, x):
    """P(a, x), Q(a, x) for exact mpf a >= 1e3 and x > 0."""
    dig = hp_digits(a, x)
    with mp.workdps(dig):
        a = mpf(a)
        x = mpf(x)
        sd = mpmath.sqrt(a)
        lg = lgamma_hp(a)
        s0 = (x - a) / sd

        def logg(s):
            with mp.workdps(dig):
                t = a + sd * s
                if t <= 0:
                    return mpf(-10**6)
                return (a - 1) * mpmath.log(t) - t - lg + mpmath.log(sd)
    return clean(smaller_tail(logg, +s0, -mpmath.sqrt(a), mpmath.inf))


def gamma_log_pdf(a, x):
    with mp.workdps(hp_digits(a, x)):
        a, x = mpf(a), mpf(x)
        return (a - 1) * mpmath.log(x) - x - lgamma_hp(a)


# --- Beta ---------------------------------------------------------------------


def log_beta(a, b):
    return lgamma_hp(a) + lgamma_hp(b) - lgamma_hp(a + b)


def small_shape_beta(a, b, x):
    """I_x(a, b) for a small shape a (b any size) by DLMF 8.17.8,
    x^a (1-x)^b / (a B(a, b)) 2F1(a + b, 1; a + 1; x), a series of positive
    terms (the quadrature would meet the singularity t^(a-1) at 0)."""
    with mp.workdps(hp_digits(a, b)):
        a, b, x = mpf(a), mpf(b), mpf(x)
        pre = mpmath.exp(a * mpmath.log(x) + b * mpmath.log1p(-x) - mpmath.log(a) - log_beta(a, b))
        return pre * mpmath.hyp2f1(a + b, 1, a + 1, x)


def beta_tails(a, b, x):
    """I_x(a, b), 1 - I_x(a, b) for exact a, b with a + b >= 1e3."""
    if x <= 0:
        return mpf(0), mpf(1)
    if x >= 1:
        return mpf(1), mpf(0)
    # The tail at the small shape's end by the series where it converges
    # within some 1e4 terms ((a + b) times the argument on that side below
    # 1e3), the other as 1 - it.
    small_end = x if a < b else 1 - x
    if min(a, b) < 50 and max(a, b) >= 1e3 and (a + b) * small_end < 1e3:
        if a < b:
            low = small_shape_beta(a, b, x)
            return low, 1 - low
        with mp.workdps(hp_digits(a, b)):
            y = 1 - mpf(x)
        up = small_shape_beta(b, a, y)
        return 1 - up, up
    dig = hp_digits(a, b, 1 / min(float(x), 1 - float(x)) if 0 < x < 1 else 1)
    with mp.workdps(dig):
        a, b, x = mpf(a), mpf(b), mpf(x)
        n = a + b
        m = a / n
        sd = mpmath.sqrt(a * b / (n * n * (n + 1)))
        lb = log_beta(a, b)
        s0 = (x - m) / sd

        def logg(s):
            with mp.workdps(dig):
                t = m + sd * s
                if t <= 0 or t >= 1:
                    return mpf(-10**6)
                return (a - 1) * mpmath.log(t) + (b - 1) * mpmath.log1p(-t) - lb + mpmath.log(sd)
        lo, hi = -m / sd, (1 - m) / sd
    return clean(smaller_tail(logg, +s0, +lo, +hi))


def beta_log_pdf(a, b, x):
    with mp.workdps(hp_digits(a, b, 1 / min(float(x), 1 - float(x)))):
        a, b, x = mpf(a), mpf(b), mpf(x)
        return (a - 1) * mpmath.log(x) + (b - 1) * mpmath.log1p(-x) - log_beta(a, b)


# --- t ------------------------------------------------------------------------


def t_log_norm(n):
    return lgamma_hp((n + 1) / 2) - lgamma_hp(n / 2) - mpmath.log(n * mpmath.pi) / 2


def t_tails(n, x):
    dig = hp_digits(n)
    with mp.workdps(dig):
        n = mpf(n)
        c = t_log_norm(n)

        def logg(s):
            with mp.workdps(dig):
                return c - (n + 1) / 2 * mpmath.log1p(s * s / n)
    return clean(smaller_tail(logg, mpf(x), -mpmath.inf, mpmath.inf))


def t_log_pdf(n, x):
    with mp.workdps(hp_digits(n)):
        n, x = mpf(n), mpf(x)
        return t_log_norm(n) - (n + 1) / 2 * mpmath.log1p(x * x / n)


def nct_tails(n, delta, x):
    """P(T <= x) = E Phi(x sqrt(V/n) - delta), V chi-square on n; V = n +
    sqrt(2n) u, u integrated over the chi-square density (gamma n/2, scale 2)."""
    dig = hp_digits(n)
    with mp.workdps(dig):
        n, delta, x = mpf(n), mpf(delta), mpf(x)
        a = n / 2
        sd = mpmath.sqrt(a)
        lg = lgamma_hp(a)

    def density(u):  # gamma(a) density in u = (w - a)/sqrt(a), w = V/2
        with mp.workdps(dig):
            w = a + sd * u
            if w <= 0:
                return mpf(0)
            return mpmath.exp((a - 1) * mpmath.log(w) - w - lg + mpmath.log(sd)), w

    def part(u, upper):
        r = density(u)
        if not isinstance(r, tuple):
            return mpf(0)
        dens, w = r
        z = x * mpmath.sqrt(w / a) - delta
        return dens * (mpmath.ncdf(-z) if upper else mpmath.ncdf(z))

    lo_lim = max(-mpmath.sqrt(a), mpf(-45))
    pts = [lo_lim] + [mpf(k) for k in range(-40, 41, 2) if lo_lim < k < 45] + [mpf(45)]
    z0 = x - delta  # the smaller tail of Phi(z0)
    upper = integrate(lambda u: part(u, True), pts) if z0 > 0 else None
    lower = integrate(lambda u: part(u, False), pts) if z0 <= 0 else None
    return (1 - upper, upper) if upper is not None else (lower, 1 - lower)


# --- Discrete -----------------------------------------------------------------


def poisson_tails(mean, k):
    """P(X <= k), P(X >= k) for integer k >= 1."""
    with mp.workdps(hp_digits(k)):
        k1 = k + 1
    lower = gamma_tails(k1, mean)[1]
    upper = gamma_tails(k, mean)[0]
    return lower, upper


def poisson_log_pmf(mean, k):
    with mp.workdps(hp_digits(mean, k)):
        return k * mpmath.log(mean) - mean - lgamma_hp(mpf(k) + 1)


def binomial_tails(n, p, k):
    """P(X <= k) = I_{1-p}(n - k, k + 1), P(X >= k) = I_p(k, n - k + 1)."""
    with mp.workdps(hp_digits(n)):
        nk, k1, nk1, q = n - k, k + 1, n - k + 1, 1 - p
    lower = beta_tails(nk, k1, q)[0] if k < n else mpf(1)
    upper = beta_tails(k, nk1, p)[0] if k > 0 else mpf(1)
    return lower, upper


def binomial_log_pmf(n, p, k):
    with mp.workdps(hp_digits(n)):
        n, k = mpf(n), mpf(k)
        return (lgamma_hp(n + 1) - lgamma_hp(k + 1) - lgamma_hp(n - k + 1) + k * mpmath.log(p) +
                (n - k) * mpmath.log1p(-p))


def negbin_tails(r, p, x):
    """Trials x up to the r-th success: P(X <= x) = I_p(r, x - r + 1),
    P(X >= x) = 1 - P(X <= x - 1) = I_{1-p}(x - r, r)."""
    with mp.workdps(hp_digits(x)):
        xr1, xr, q = x - r + 1, x - r, 1 - p
    lower = beta_tails(r, xr1, p)[0]
    upper = beta_tails(xr, r, q)[0] if x > r else mpf(1)
    return lower, upper


def negbin_log_pmf(r, p, x):
    with mp.workdps(hp_digits(x)):
        r, x = mpf(r), mpf(x)
        return (lgamma_hp(x) - lgamma_hp(r) - lgamma_hp(x - r + 1) + r * mpmath.log(p) +
                (x - r) * mpmath.log1p(-p))


# --- Noncentral chi-square and F (Poisson mixtures) ---------------------------


def poisson_weights(half_ncp):
    lam = mpf(half_ncp)
    count = int(float(lam) + 12 * math.sqrt(float(lam)) + 40)
    w = [mpmath.exp(-lam)]
    for j in range(1, count):
        w.append(w[-1] * lam / j)
    return w


def ncchisq_tails(df, ncp, x):
    a = mpmath.ldexp(mpf(df), -1)
    y = mpmath.ldexp(x, -1)
    lower, upper = gamma_tails(a, y)
    lo = up = mpf(0)
    dig = hp_digits(a, y)
    for j, w in enumerate(poisson_weights(mpf(ncp) / 2)):
        lo += w * lower
        up += w * upper
        with mp.workdps(dig):
            term = mpmath.exp((a + j) * mpmath.log(y) - y - lgamma_hp(a + j + 1))
        lower, upper = lower - term, upper + term
    return lo, up


def ncf_tails(m, n, ncp, x):
    a, b = mpf(m) / 2, mpf(n) / 2
    with mp.workdps(hp_digits(a, b)):
        y = mpf(m) * mpf(x) / (mpf(m) * mpf(x) + mpf(n))
    lower, upper = beta_tails(a, b, y)
    lo = up = mpf(0)
    dig = hp_digits(a, b)
    for j, w in enumerate(poisson_weights(mpf(ncp) / 2)):
        lo += w * lower
        up += w * upper
        with mp.workdps(dig):
            aj = a + j
            term = mpmath.exp(aj * mpmath.log(y) + b * mpmath.log1p(-y) - mpmath.log(aj) -
                              log_beta(aj, b))
        lower, upper = lower - term, upper + term
    return lo, up


# --- Rows ---------------------------------------------------------------------

ROWS = []


def ulp(x):
    x = abs(float(x))
    return math.nextafter(x, math.inf) - x


def emit(family, function, x, params, value, cond=0):
    p = [repr(float(v)) for v in params] + ["0"] * (3 - len(params))
    if value is None:
        return
    if value != value:  # nan
        text = "nan"
    elif abs(value) < mpf(10) ** -300:
        text = "0"
    else:
        text = mpmath.nstr(value, 20, strip_zeros=False, min_fixed=-1, max_fixed=-1)
    c = "0" if cond == 0 else mpmath.nstr(cond, 3)
    ROWS.append((family, function, repr(float(x)), *p, text, c))
    print(",".join(ROWS[-1]), file=sys.stderr, flush=True)


def condition(x, log_pdf_at_x, tail, sd, other=1):
    """|x f / F| where doubles around x are more than sd apart, else 0; where
    either tail there is below 1e-300, the next double lies beyond the bulk
    and the tails have no condition to speak of (1e300)."""
    if ulp(x) <= float(sd):
        return 0
    if min(tail, other) < mpf(10)**-300:
        return mpf(10)**300
    c = abs(mpf(x)) * mpmath.exp(log_pdf_at_x) / tail
    return c if c > 1e-300 else 0


def pdf_condition(x, mean, sd):
    """|s| |mean| / sd + 1, s = (x - mean) / sd: for a law close to the normal,
    |x d ln f / dx| (and as much for the rounding of the mean or the
    complement 1 - p a mass is measured from); the density changes by that
    many times the relative error of its inputs, as in the condition column
    of extreme_shapes.csv."""
    s = abs(mpf(x) - mpf(mean)) / mpf(sd)
    return s * abs(mpf(mean)) / mpf(sd) + 1


def points(mean, sd, lo=-math.inf, hi=math.inf, integer=False):
    out = []
    for k in STEPS:
        v = float(mpf(mean) + k * mpf(sd))
        if integer:
            v = float(math.floor(v))
        if lo < v < hi and v not in out:
            out.append(v)
    if ulp(mean) > float(sd):  # neighbouring doubles: far in the tails
        for v in (math.nextafter(float(mean), -math.inf), math.nextafter(float(mean), math.inf)):
            if lo < v < hi and v not in out:
                out.append(v)
    return out


def continuous(family, params, tails_at, log_pdf_at, mean, sd, lo=-math.inf, hi=math.inf,
               scale=1.0, probs=PROBS, rounded=False):
    """pdf/lower/upper rows at the points, quantile rows at PROBS. tails_at
    and log_pdf_at take the standard variable; scale multiplies x."""
    for x in points(mean, sd, lo, hi):
        lp = log_pdf_at(d(x))
        lower, upper = tails_at(d(x))
        # A scale other than 1: the rounding of x/scale is part of every
        # method, so its condition counts whatever the spacing of doubles.
        scaled = 1e-300 if scale != 1.0 or rounded else 1
        emit(family, "pdf", x * scale, params, mpmath.exp(lp - mpmath.log(scale)),
             pdf_condition(x, mean, sd))
        emit(family, "lower", x * scale, params, lower,
             condition(x, lp, lower, sd * scaled, upper))
        emit(family, "upper", x * scale, params, upper,
             condition(x, lp, upper, sd * scaled, lower))
    for p in probs:
        emit(family, "inv", p, params, quantile(tails_at, d(p), mean, sd, lo, hi) * scale)


def illinois(f, z):
    """A root of the increasing-or-decreasing f near z: a bracket by doubling
    steps from 1/2 from z, then the Illinois method to 1e-32."""
    a, fa = z, f(z)
    step = mpf(1) / 2
    while True:
        b = a + step
        fb = f(b)
        if fa * fb <= 0:
            break
        if abs(fb) > abs(fa):  # wrong direction
            step = -step
        else:
            a, fa = b, fb
            step *= 2
    side = 0
    for _ in range(200):
        c = b - fb * (b - a) / (fb - fa)
        fc = f(c)
        if fc == 0 or abs(b - a) < mpf(10)**-32 or abs(c - b) < mpf(10)**-32:
            return c
        if fc * fb < 0:
            a, fa = b, fb
            side = 0
        else:
            fa = fa / 2 if side == 1 else fa
            side = 1
        b, fb = c, fc
    return b


def quantile(tails_at, p, mean, sd, lo, hi):
    """The x with lower tail p, by the secant method in s on the log of the
    smaller tail."""
    which, target = (0, p) if p <= 0.5 else (1, 1 - p)
    mean, sd = mpf(mean), mpf(sd)

    dig = hp_digits(mean, 1 / sd)

    def f(s):
        with mp.workdps(dig):
            x = mean + sd * s
        if x <= lo:
            return mpf(-10**6) if which == 0 else mpf(10**6)
        if x >= hi:
            return mpf(10**6) if which == 0 else mpf(-10**6)
        t = tails_at(x)[which]
        return mpmath.log(t) - mpmath.log(target) if t > 0 else mpf(-10**6)

    z = mpmath.sqrt(2) * mpmath.erfinv(2 * p - 1) if p > 1e-300 else mpf(-37.5)
    s = illinois(f, z)
    with mp.workdps(dig):
        x = mean + sd * s
    # A quantile within the solver's tolerance of 0 is 0 (the median of a
    # symmetric law).
    return mpf(0) if abs(x) < sd * mpf(10)**-30 else x


def discrete(family, params, tails_at, log_pmf_at, mean, sd, lo, hi=math.inf):
    for x in points(mean, sd, lo, hi, integer=True):
        lp = log_pmf_at(d(x))
        lower, upper = tails_at(d(x))
        emit(family, "pdf", x, params, mpmath.exp(lp), pdf_condition(x, mean, sd))
        emit(family, "lower", x, params, lower, condition(x, lp, lower, sd, upper))
        emit(family, "upper", x, params, upper, condition(x, lp, upper, sd, lower))
    for p in PROBS:
        emit(family, "inv", p, params, discrete_quantile(tails_at, d(p), mean, sd, lo))


def discrete_quantile(tails_at, p, mean, sd, lo):
    """The smallest double >= the smallest integer k with P(X <= k) >= p:
    the root k* of the lower tail continued to real k (a gamma or beta tail
    with a real shape), rounded up and checked on its integer neighbours."""
    if tails_at(mpf(lo + 1))[0] >= p:
        return mpf(lo + 1)
    q = quantile(tails_at, p, mean, sd, lo + 1, math.inf)
    with mp.workdps(hp_digits(mean)):
        k = mpmath.ceil(q)
        v = float(k)
        if mpf(v) < k:
            v = math.nextafter(v, math.inf)

    # The root is known to sd 1e-38 only: step to the smallest whole double
    # whose lower tail reaches p (steps of 1 below 2^53, of one double above).
    def down(v):
        return v - 1 if v < 2**53 else math.nextafter(v, -math.inf)

    def up(v):
        return v + 1 if v < 2**53 else math.nextafter(v, math.inf)
    while tails_at(mpf(v))[0] < p:
        v = up(v)
    while down(v) > lo and tails_at(mpf(down(v)))[0] >= p:
        v = down(v)
    return mpf(v)


# --- Families -----------------------------------------------------------------


def gamma_rows():
    for a in BIG:
        sd = mpmath.sqrt(d(a))
        continuous("gamma", (a, 1.0), lambda x: gamma_tails(d(a), x),
                   lambda x: gamma_log_pdf(d(a), x), a, sd, lo=0.0)
    # A huge scale with a moderate shape.
    a, scale = 1e6, 1e250
    continuous("gamma", (a, scale), lambda x: gamma_tails(d(a), x),
               lambda x: gamma_log_pdf(d(a), x), a, 1e3, lo=0.0, scale=scale)


def chisq_rows():
    for n in BIG:
        sd = mpmath.sqrt(2 * d(n))
        continuous("chisq", (n,), lambda x: gamma_tails(d(n) / 2, mpmath.ldexp(x, -1)),
                   lambda x: gamma_log_pdf(d(n) / 2, mpmath.ldexp(x, -1)) - mpmath.log(2), n, sd, lo=0.0)


def beta_rows():
    for a in BIG:
        for b in (a, 3.0):
            if b == 3.0 and a > 1e10:
                continue  # the mass lies within one double of 1
            n = d(a) + d(b)
            m = d(a) / n
            sd = mpmath.sqrt(d(a) * d(b) / (n * n * (n + 1)))
            continuous("beta", (a, b), lambda x: beta_tails(d(a), d(b), x),
                       lambda x: beta_log_pdf(d(a), d(b), x), m, sd, lo=0.0, hi=1.0,
                       probs=PROBS if b == a else (1e-10, 0.5))


def t_rows():
    for n in BIG:
        continuous("t", (n, 0.0), lambda x: t_tails(d(n), x), lambda x: t_log_pdf(d(n), x), 0.1,
                   1.0)
        for delta in (0.1, 5.0):
            for x in (delta - 3.0, delta, delta + 3.0, delta - 30.0, delta + 30.0):
                lower, upper = nct_tails(d(n), d(delta), d(x))
                emit("t", "lower", x, (n, delta), lower)
                emit("t", "upper", x, (n, delta), upper)
            for p in PROBS:
                if p in (1e-10, 0.5, 0.9):
                    emit("t", "inv", p, (n, delta),
                         quantile(lambda x: nct_tails(d(n), d(delta), x), d(p), delta, 1.0,
                                  -math.inf, math.inf))


def f_rows():
    for n in BIG:
        for m in (n, 5.0):
            a, b = d(m) / 2, d(n) / 2
            # F = (b/a) Y/(1-Y), Y ~ Beta(a, b): tails at y = m x / (m x + n).
            def tails_at(x, a=a, b=b, m=m, n=n):
                with mp.workdps(hp_digits(m, n)):
                    y = d(m) * x / (d(m) * x + d(n))
                return beta_tails(a, b, y)

            def log_pdf(x, m=m, n=n):
                with mp.workdps(hp_digits(m, n)):
                    m_, n_ = d(m), d(n)
                    return (m_ / 2 * mpmath.log(m_ / n_) + (m_ / 2 - 1) * mpmath.log(x) -
                            (m_ + n_) / 2 * mpmath.log1p(m_ * x / n_) - log_beta(m_ / 2, n_ / 2))
            mean = 1.0 if m == n else 1.0
            sd = mpmath.sqrt(2 / d(m) + 2 / d(n))
            # x enters through y = m x / (m x + n), a rounding every method
            # makes: its condition counts.
            continuous("f", (m, n), tails_at, log_pdf, mean, sd, lo=0.0,
                       probs=PROBS if m == n else (0.3, 0.9), rounded=True)


def noncentral_rows():
    for n in BIG:
        for ncp in (1.0, 100.0):
            mean = d(n) + ncp
            sd = mpmath.sqrt(2 * (d(n) + 2 * ncp))
            for x in points(mean, sd, 0.0):
                lower, upper = ncchisq_tails(d(n), d(ncp), d(x))
                far = ulp(x) > float(sd)
                c = 1e300 if far and min(lower, upper) < 1e-300 else 0
                emit("chisq", "lower", x, (n, ncp), lower, c)
                emit("chisq", "upper", x, (n, ncp), upper, c)
            for p in (1e-10, 0.9):
                emit("chisq", "inv", p, (n, ncp),
                     quantile(lambda x: ncchisq_tails(d(n), d(ncp), x), d(p), mean, sd, 0.0,
                              math.inf))
        ncp = 10.0
        sd = mpmath.sqrt(4 / d(n))
        for x in points(1.0, sd, 0.0):
            lower, upper = ncf_tails(d(n), d(n), d(ncp), d(x))
            # The condition of the rounding of y = m x / (m x + n): |x F'/F|
            # by a central difference of relative step 1e-20.
            with mp.workdps(hp_digits(n)):
                h = mpf(10)**-20
                xu, xd = d(x) * (1 + h), d(x) * (1 - h)
            k = 0 if lower < upper else 1  # the smaller tail keeps the digits of the change
            slope = (ncf_tails(d(n), d(n), d(ncp), xu)[k] -
                     ncf_tails(d(n), d(n), d(ncp), xd)[k]) / (2 * h)
            far = ulp(x) > float(sd)  # neighbouring doubles more than sd apart
            deep = min(lower, upper) < 1e-300
            emit("f", "lower", x, (n, n, ncp), lower,
                 1e300 if far and deep else abs(slope / lower) if lower > 1e-300 else 0)
            emit("f", "upper", x, (n, n, ncp), upper,
                 1e300 if far and deep else abs(slope / upper) if upper > 1e-300 else 0)


def poisson_rows():
    for mean in BIG:
        sd = mpmath.sqrt(d(mean))
        discrete("poisson", (mean,), lambda k: poisson_tails(d(mean), k),
                 lambda k: poisson_log_pmf(d(mean), k), mean, sd, 0)


def binomial_rows():
    p = 0.3
    for n in BIG:
        mean = d(n) * d(p)
        sd = mpmath.sqrt(mean * (1 - d(p)))
        discrete("binomial", (n, p), lambda k: binomial_tails(d(n), d(p), k),
                 lambda k: binomial_log_pmf(d(n), d(p), k), mean, sd, 0, n + 1)


def negbin_rows():
    # Not p = 1/2: there P(X <= 2r - 1) = 1/2 exactly (a fair binomial on
    # 2r - 1 trials), a tie that a quadrature cannot decide.
    p = 0.4
    for r in BIG:
        mean = d(r) / d(p)
        sd = mpmath.sqrt(d(r) * (1 - d(p))) / d(p)
        discrete("negbinomial", (p, r), lambda x: negbin_tails(d(r), d(p), x),
                 lambda x: negbin_log_pmf(d(r), d(p), x), mean, sd, r - 1)


def geometric_rows():
    for q in BIG:
        p = 1 / q
        dp = d(p)
        mean = 1 / dp
        sd = mpmath.sqrt(1 - dp) / dp

        def tails_at(x, dp=dp):
            with mp.workdps(hp_digits(1 / dp)):
                lower = -mpmath.expm1(x * mpmath.log1p(-dp))
                upper = mpmath.exp((x - 1) * mpmath.log1p(-dp))
            return lower, upper

        def log_pmf(x, dp=dp):
            with mp.workdps(hp_digits(1 / dp)):
                return (x - 1) * mpmath.log1p(-dp) + mpmath.log(dp)
        for x in sorted({float(math.floor(float(mean * k))) for k in (1e-3, 0.5, 1, 3, 30)}):
            if x >= 1:
                lower, upper = tails_at(d(x))
                emit("geometric", "pdf", x, (p,), mpmath.exp(log_pmf(d(x))))
                emit("geometric", "lower", x, (p,), lower)
                emit("geometric", "upper", x, (p,), upper)
        for prob in PROBS:
            # Smallest x with 1 - (1-p)^x >= prob: x = ceil(ln(1-prob)/ln(1-p)).
            with mp.workdps(hp_digits(1 / dp)):
                k = mpmath.ceil(mpmath.log1p(-d(prob)) / mpmath.log1p(-dp))
            v = float(k)
            if mpf(v) < k:
                v = math.nextafter(v, math.inf)
            emit("geometric", "inv", prob, (p,), mpf(max(v, 1.0)))


def location_rows():
    """Normal, logistic, Laplace, Cauchy and the extreme-value laws at a
    location of 1e300 with a scale of 1e290, and at a scale of 1e300."""
    for mu, sigma in ((1e300, 1e290), (0.0, 1e300), (-1e300, 1e299)):
        for k in (0.0, -3.0, 3.0, -30.0, 30.0):
            x = float(d(mu) + k * d(sigma))
            z = (d(x) - d(mu)) / d(sigma)
            laws = {
                "normal": (mpmath.ncdf(z), mpmath.ncdf(-z), mpmath.npdf(z)),
                "logistic": (1 / (1 + mpmath.exp(-z)), 1 / (1 + mpmath.exp(z)),
                             mpmath.exp(-z) / (1 + mpmath.exp(-z))**2),
                "laplace": ((mpmath.exp(z) / 2, 1 - mpmath.exp(z) / 2, mpmath.exp(z) / 2)
                            if z < 0 else
                            (1 - mpmath.exp(-z) / 2, mpmath.exp(-z) / 2, mpmath.exp(-z) / 2)),
                "cauchy": (mpf(1) / 2 + mpmath.atan(z) / mpmath.pi,
                           mpf(1) / 2 - mpmath.atan(z) / mpmath.pi, 1 / (mpmath.pi * (1 + z * z))),
                "lev": (mpmath.exp(-mpmath.exp(-z)), -mpmath.expm1(-mpmath.exp(-z)),
                        mpmath.exp(-z - mpmath.exp(-z))),
                "sev": (-mpmath.expm1(-mpmath.exp(z)), mpmath.exp(-mpmath.exp(z)),
                        mpmath.exp(z - mpmath.exp(z))),
            }
            for name, (lower, upper, dens) in laws.items():
                emit(name, "pdf", x, (mu, sigma), dens / d(sigma))
                emit(name, "lower", x, (mu, sigma), lower)
                emit(name, "upper", x, (mu, sigma), upper)
        for p in PROBS:
            dp = d(p)
            z = mpmath.sqrt(2) * mpmath.erfinv(2 * dp - 1) if p > 1e-300 else None
            if z is None:
                z = mpmath.findroot(lambda t: mpmath.log(mpmath.ncdf(t)) - mpmath.log(dp), -37)
            emit("normal", "inv", p, (mu, sigma), d(mu) + d(sigma) * z)


def weibull_rows():
    """Weibull at shapes 1e6..1e15 (the spread is scale/shape) and scale 1e300."""
    for k in (1e6, 1e8, 1e10, 1e15):
        for scale in (1.0, 1e300):
            for step in (0.0, -3.0, 3.0, -30.0):
                x = float(d(scale) * (1 + step / d(k)))
                with mp.workdps(80):
                    u = (d(x) / d(scale)) ** d(k)
                    lower, upper = -mpmath.expm1(-u), mpmath.exp(-u)
                    dens = d(k) / d(scale) * u / (d(x) / d(scale)) * mpmath.exp(-u)
                # x / scale rounds unless the scale is 1: u moves by k eps.
                c = 0 if scale == 1.0 else d(k) * (1 + u)
                emit("weibull", "pdf", x, (k, scale), dens, abs(d(k) * (1 - u)) + 1 + c)
                emit("weibull", "lower", x, (k, scale), lower, c)
                emit("weibull", "upper", x, (k, scale), upper, c)


def self_check():
    for a in (mpf(10000), mpf(30000)):
        for x in (a - 30 * mpmath.sqrt(a), a, a + 40 * mpmath.sqrt(a)):
            mine = gamma_tails(a, x)
            if x <= a:
                m_, r_ = mine[0], mpmath.gammainc(a, 0, x, regularized=True)
            else:
                m_, r_ = mine[1], mpmath.gammainc(a, x, mpmath.inf, regularized=True)
            assert abs(m_ - r_) <= mpf(10)**-25 * r_, ("gamma", a, x, m_, r_)
    for a, b, x in ((mpf(400), mpf(600), mpf("0.3")), (mpf(400), mpf(600), mpf("0.4")),
                    (mpf("2.5"), mpf(2000), mpf("0.001")), (mpf(2000), mpf("2.5"), mpf("0.999"))):
        mine = beta_tails(a, b, x)
        ref = mpmath.betainc(a, b, 0, x, regularized=True)
        assert abs(mine[0] - ref) <= mpf(10)**-25 * ref, ("beta", x, mine, ref)


ORDER = ["gamma", "chisq", "beta", "t", "f", "noncentral", "poisson", "binomial", "negbin",
         "geometric", "location", "weibull"]


def main():
    """No arguments: every family into large_parameters.csv. --part NAME: one
    family into large_parameters.csv.NAME (to run families side by side);
    --merge: the parts, in order, into large_parameters.csv."""
    out = os.path.join(DATA, "large_parameters.csv")
    header = "family,function,x,param1,param2,param3,expected,condition"
    if sys.argv[1:2] == ["--merge"]:
        for name in ORDER:
            with open(out + "." + name) as part:
                ROWS.extend(tuple(line.rstrip("\n").split(","))
                            for line in part if not line.startswith("#"))
        write_rows(out, header, ROWS)
        return
    self_check()
    names = [sys.argv[2]] if sys.argv[1:2] == ["--part"] else ORDER
    for name in names:
        globals()[name + "_rows"]()
    write_rows(out + ("." + names[0] if len(names) == 1 else ""), header, ROWS)


if __name__ == "__main__":
    main()
