#!/usr/bin/python3
"""Derivation check of the two series behind Tha_c (src/utilities/elv/owen.cpp).

Tha_c(h, a) = integral from h to infinity of phi(x) Q(a x) dx, h >= 0, a > 0.
With T(h, inf) = Q(h)/2 and dT/da = exp(-h^2 (1 + a^2)/2) / (2 pi (1 + a^2)),

  Tha_c(h, a) = 1/(2 pi) integral_a^inf exp(-h^2 (1 + t^2)/2) / (1 + t^2) dt.   (*)

Series 1 (a > 1): 1/(1 + t^2) = sum_k (-1)^k t^(-2k-2) for t > 1, and with
u = h^2 t^2/2 each term becomes an incomplete gamma function at g = (a h)^2/2:

  Tha_c = phi(h) sum_k [-1/(2 h sqrt(pi))] (-h^2/2)^(k+1) Gamma(-k-1/2, g).

In scaled form, G_k = g^(k+1/2) e^g Gamma(-k-1/2, g) (bounded, 1/(k+1/2) at g = 0),

  Tha_c = phi(h) e^(-g) / (2 sqrt(2 pi)) sum_k (-1)^k a^(-2k-1) G_k,

with G_k = (1 - g G_(k-1)) / (k + 1/2) from g G_(-1) = sqrt(g) e^g Gamma(1/2, g)
for g <= 1 (the downward recurrence of the incomplete gamma, stable there), and
for g > 1 G_k = J(g, -k-1/2)/g, J(x, s) = e^x x^(1-s) Gamma(s, x) from Legendre's
continued fraction. Term ratio at most 1/a^2.

Series 2 (a near 1): w = 1 - a, t = 1 - v in (*), s = v (1 - v/2), 1 + t^2 = 2 (1 - s):

  Tha_c = Q(h)^2/2 + sum / (4 pi),
  sum   = sum_n e^(-h^2) c_n I_n,   c_n = sum_(j<=n) h^(2j)/j!,
  I_n   = integral_0^w s^n dv = w^(n+1) sum_m C(n, m) (-w/2)^m / (n+m+1).

Each series is evaluated here in high precision and compared with an
independent evaluation of (*) after the substitution h^2 t^2/2 = h^2 a^2/2 + y.
Run: /usr/bin/python3 tools/reference/derive_owen_series.py (asserts, prints
the largest differences).
"""
import mpmath
from mpmath import mp, mpf

mp.dps = 50


def reference(h, a):
    """Integral (*) over y in [0, inf) with weight e^-y; h >= 0."""
    h, a = mpf(h), mpf(a)
    if h == 0:
        return mpmath.atan(1 / a) / (2 * mpmath.pi)
    h2 = h * h

    def f(y):
        t = mpmath.sqrt(a * a + 2 * y / h2)
        return mpmath.exp(-y) / ((1 + t * t) * h2 * t)

    c = min(h2 * a * a / 2, 1)
    pts = [0] + [c * mpf(2) ** k for k in range(-30, 8)] + [mpmath.inf]
    return mpmath.exp(-h2 * (1 + a * a) / 2) * mpmath.quad(f, pts, maxdegree=10) / (2 * mpmath.pi)


def series1_literal(h, a, terms=200):
    """The unscaled form: start -1/(2 h sqrt(pi)), factor -h^2/2 per term."""
    h, a = mpf(h), mpf(a)
    g = (a * h) ** 2 / 2
    c = -1 / (2 * h * mpmath.sqrt(mpmath.pi))
    s = 0
    for k in range(terms):
        c *= -h * h / 2
        s += c * mpmath.gammainc(-k - mpf(1) / 2, g)
    return mpmath.npdf(h) * s


def series1_scaled(h, a, terms=200):
    h, a = mpf(h), mpf(a)
    g = (a * h) ** 2 / 2
    s = 0
    gPrev = mpmath.sqrt(g) * mpmath.exp(g) * mpmath.gammainc(mpf(1) / 2, g)  # g G_(-1)
    for k in range(terms):
        if g <= 1:
            G = (1 - gPrev) / (k + mpf(1) / 2)
            gPrev = g * G
        else:
            G = mpmath.exp(g) * g ** (k + mpf(1) / 2) * mpmath.gammainc(-k - mpf(1) / 2, g)
        s += (-1) ** k * a ** (-2 * k - 1) * G
    return mpmath.npdf(h) * mpmath.exp(-g) / (2 * mpmath.sqrt(2 * mpmath.pi)) * s


def series2(h, a, terms=400):
    h, a = mpf(h), mpf(a)
    w = 1 - a
    total = 0
    p = mpmath.exp(-h * h)  # Poisson weight e^-h^2 h^(2j)/j!
    cum = 0
    for n in range(terms):
        if n > 0:
            p *= h * h / n
        cum += p
        inner, term = 0, mpf(1)
        for m in range(n + 1):
            if m > 0:
                term *= (-w / 2) * (n - m + 1) / m
            inner += term / (n + m + 1)
        total += cum * w ** (n + 1) * inner
    return total / (4 * mpmath.pi) + mpmath.ncdf(-h) ** 2 / 2


def main():
    worst = {}
    cases1 = [(h, a) for h in (0.05, 0.3, 0.7, 1.0, 2.0, 5.0) for a in (1.34, 2.0, 10.0)]
    cases2 = [(h, a) for h in (0.0, 0.3, 1.0, 2.0, 4.0) for a in (0.75, 0.9, 0.999, 1.0)]
    for h, a in cases1:
        ref = reference(h, a)
        for name, f in (("series 1 literal", series1_literal), ("series 1 scaled", series1_scaled)):
            e = abs(f(h, a) / ref - 1)
            worst[name] = max(worst.get(name, 0), e)
    for h, a in cases2:
        e = abs(series2(h, a) / reference(h, a) - 1)
        worst["series 2"] = max(worst.get("series 2", 0), e)
    # Reflection: Tha_c(h, a) + Tha_c(a h, 1/a) = Q(h) Q(a h).
    for h, a in ((0.7, 0.5), (3.0, 0.8)):
        h, a = mpf(h), mpf(a)
        e = abs(reference(h, a) + reference(a * h, 1 / a) - mpmath.ncdf(-h) * mpmath.ncdf(-a * h))
        worst["reflection"] = max(worst.get("reflection", 0), e / (mpmath.ncdf(-h) * mpmath.ncdf(-a * h)))
    for name, e in worst.items():
        print("%-18s largest relative difference %s" % (name, mpmath.nstr(e, 3)))
        assert e < mpf(10) ** -30, name


if __name__ == "__main__":
    main()
