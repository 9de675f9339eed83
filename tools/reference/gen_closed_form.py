#!/usr/bin/env python3
"""Reference values for the closed-form families (Cauchy, Logistic,
LogLogistic, Triangular, Uniform): density, lower and upper tail each computed
exactly, and quantiles of exact double probabilities.

Writes tests/data/closed_form.csv with rows
    family,function,x,param1,param2,param3,expected
where function is pdf, lower, upper or inv and unused parameters are 0.
Run: python3 tools/reference/gen_closed_form.py (needs python3-mpmath).
"""
import os
import sys

import mpmath
from mpmath import mpf

sys.path.insert(0, os.path.dirname(__file__))
from refdata import d, write_rows  # noqa: E402

OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data", "closed_form.csv")


def logistic_lower(z):
    return 1 / (1 + mpmath.exp(-z))


def logistic_upper(z):
    return 1 / (1 + mpmath.exp(z))


def logistic_pdf(z):
    e = mpmath.exp(-abs(z))
    return e / (1 + e) ** 2


def cauchy_lower(z):
    return mpmath.mpf(1) / 2 + mpmath.atan(z) / mpmath.pi


def rows_for(family, params, xs, ps, pdf, lower, upper, inv):
    p3 = list(params) + [0.0] * (3 - len(params))
    out = []
    for x in xs:
        X = d(x)
        out.append([family, "pdf", float(x)] + p3 + [pdf(X)])
        out.append([family, "lower", float(x)] + p3 + [lower(X)])
        out.append([family, "upper", float(x)] + p3 + [upper(X)])
    for p in ps:
        out.append([family, "inv", float(p)] + p3 + [inv(d(p))])
    return out


def tail_ps():
    ps = [1e-300, 1e-200, 1e-100, 1e-30, 1e-15, 1e-8, 1e-3, 0.01, 0.1, 0.2, 0.25, 0.3,
          0.4, 0.45, 0.49, 0.4999999, 0.5000001, 0.51, 0.55, 0.6, 0.7, 0.75, 0.8, 0.9,
          0.99, 0.999, 1 - 1e-8, 1 - 1e-15]
    return ps


def main():
    rows = []
    # Logistic
    for loc, scale in [(0.0, 1.0), (2.5, 0.5), (-100.0, 30.0)]:
        L, S = d(loc), d(scale)
        xs = [loc + scale * t for t in (-700, -300, -40, -10, -2, -0.5, -1e-6, 0, 1e-6, 0.5, 1, 3,
                                        10, 40, 300, 690)]
        rows += rows_for(
            "logistic", (loc, scale), xs, tail_ps(),
            lambda X: logistic_pdf((X - L) / S) / S,
            lambda X: logistic_lower((X - L) / S),
            lambda X: logistic_upper((X - L) / S),
            lambda P: L + S * mpmath.log(P / (1 - P)))
    # Log-logistic
    for loc, scale, thr in [(0.0, 1.0, 0.0), (1.0, 0.25, 5.0), (-2.0, 3.0, -1.0)]:
        L, S, T = d(loc), d(scale), d(thr)
        xs = [thr + v for v in (1e-300, 1e-100, 1e-10, 0.01, 0.5, 1.0, 2.0, 10.0, 1e5, 1e100)
              if thr + v != thr]
        rows += rows_for(
            "loglogistic", (loc, scale, thr), xs, [p for p in tail_ps() if p > 1e-100],
            lambda X: logistic_pdf((mpmath.log(X - T) - L) / S) / S / (X - T),
            lambda X: logistic_lower((mpmath.log(X - T) - L) / S),
            lambda X: logistic_upper((mpmath.log(X - T) - L) / S),
            lambda P: T + mpmath.exp(L + S * mpmath.log(P / (1 - P))))
    # Cauchy
    for loc, scale in [(0.0, 1.0), (3.0, 2.0), (-1e3, 1e-3)]:
        L, S = d(loc), d(scale)
        xs = [loc + scale * t for t in (-1e300, -1e200, -1e20, -1e8, -100, -2, -1, -0.5, -1e-9, 0,
                                        1e-9, 0.25, 1, 1.5, 7, 1e5, 1e15, 1e250)]
        rows += rows_for(
            "cauchy", (loc, scale), xs, tail_ps(),
            lambda X: 1 / (mpmath.pi * S * (1 + ((X - L) / S) ** 2)),
            lambda X: cauchy_lower((X - L) / S),
            lambda X: cauchy_lower(-(X - L) / S),
            lambda P: L - S * mpmath.cot(mpmath.pi * P))
    # Triangular
    for lo, mo, up in [(0.0, 0.5, 1.0), (-2.0, -1.5, 10.0), (1.0, 1.0, 4.0), (0.0, 3.0, 3.0)]:
        A, M, B = d(lo), d(mo), d(up)

        def tri_lower(X, A=A, M=M, B=B):
            if X <= A:
                return mpf(0)
            if X >= B:
                return mpf(1)
            if X <= M:
                return (X - A) ** 2 / ((B - A) * (M - A))
            return 1 - (B - X) ** 2 / ((B - A) * (B - M))

        def tri_pdf(X, A=A, M=M, B=B):
            if X < A or X > B:
                return mpf(0)
            if X == M:
                return 2 / (B - A)
            if X < M:
                return 2 * (X - A) / ((B - A) * (M - A))
            return 2 * (B - X) / ((B - A) * (B - M))

        def tri_inv(P, A=A, M=M, B=B):
            if P >= (M - A) / (B - A):
                return B - mpmath.sqrt((1 - P) * (B - A) * (B - M))
            return A + mpmath.sqrt(P * (B - A) * (M - A))

        width = up - lo
        xs = sorted(set([lo - 1, lo, lo + 1e-12 * width, lo + 0.1 * width, mo - 1e-9 * width, mo,
                         mo + 1e-9 * width, lo + 0.9 * width, up - 1e-12 * width, up, up + 1]))
        xs = [x for x in xs if not (x == mo and (mo == lo or mo == up))]
        rows += rows_for("triangular", (lo, mo, up), xs, tail_ps(), tri_pdf, tri_lower,
                         lambda X, f=tri_lower: 1 - f(X) if X <= A or X >= B else
                         ((B - X) ** 2 / ((B - A) * (B - M)) if X > M else
                          1 - (X - A) ** 2 / ((B - A) * (M - A))),
                         tri_inv)
    # Uniform
    for lo, up in [(0.0, 1.0), (-3.0, 7.5)]:
        A, B = d(lo), d(up)
        xs = [lo - 1, lo, lo + 1e-300, lo + 0.3, (lo + up) / 2, up - 1e-9, up, up + 2]

        def clamp(v):
            return max(mpf(0), min(mpf(1), v))
        rows += rows_for(
            "uniform", (lo, up), xs, [0.0, 1e-300, 0.25, 0.5, 0.9, 1.0],
            lambda X: mpf(0) if X < A or X > B else 1 / (B - A),
            lambda X: clamp((X - A) / (B - A)),
            lambda X: clamp((B - X) / (B - A)),
            lambda P: A + P * (B - A))
    write_rows(OUT, "family,function,x,param1,param2,param3,expected", rows)
    print("wrote", len(rows), "rows to", os.path.normpath(OUT))


if __name__ == "__main__":
    main()
