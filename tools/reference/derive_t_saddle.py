"""Derive and check the closed saddle-point form of the far lower tail of the
noncentral t, P(T <= t) for T = (Z + delta)/sqrt(V/df).

With x = t/sqrt(df), d = delta/sqrt(df), Y = Z/sqrt(df) and W = sqrt(V/df),
  P = P(Y - x W <= -d) = c * int_{y - x w <= -d} w^(df-1) exp(-df (w^2 + y^2)/2),
c = 2 (df/2)^(df/2)/Gamma(df/2) * sqrt(df/(2 pi)). In the coordinates
s = y - x w (region s <= -d) and w, the exponent is -(df/2) psi~(w; s) with
  psi~ = (s + x w)^2 + w^2 - ln(w^2).
For fixed s the inner integral over w is of Laplace type, with its stationary
point w*(s) the root of x (s + x w) + w - 1/w = 0; at s = -d (the boundary
point nearest in the exponent) that is the stationary point of
u^2 + r^2 - ln(r^2) with u = d - x r:
  (1 + x^2) r^2 - x d r - 1 = 0,
  r = (x d + sqrt(x^2 d^2 + 4 (1 + x^2)))/(2 (1 + x^2)).
The outer variable is eta = sqrt(psi(s)), psi(s) = min_w psi~ - 1, so that
the outer integral is exactly int_{W}^{inf} exp(-df eta^2/2) H(eta) d eta
with W = sqrt(h), h = u^2 + r^2 - ln(r^2) - 1, u = d - x r. Expanding H at
the end point eta = W (Temme's uniform treatment, the end point never being
the saddle since u >= d > 0):
  int_W^inf e^(-df eta^2/2) (H0 + H1 (eta-W) + H2 (eta-W)^2/2)
    = sqrt(2 pi/df) H0 [Q + (c1/sqrt df)(f - z Q) + (c2/df)((1+z^2) Q - z f)]
with z = W sqrt(df), c1 = H1/H0, c2 = H2/(2 H0). The inner Laplace integral
contributes the factor (1 + A/df) of its first correction term. The script
prints the C expressions of c1, c2 and A in x, r, u, W and checks the
formula against mpmath's tail integral, printing the relative errors.
"""
import os
import sys

import mpmath
import sympy as sp

sys.path.insert(0, os.path.dirname(__file__))
from gen_elv_t_noncentral import tail  # noqa: E402

x, s, n = sp.symbols("x s n", real=True)
r, u, W = sp.symbols("r u W", positive=True)
w = sp.Function("w")(s)

K = 1 + x**2 + 1 / w**2
# dw*/ds from the stationarity x (s + x w) + w - 1/w = 0.
dw = -x / K


def D(expr):
    return sp.diff(expr, s).subs(sp.Derivative(w, s), dw)


psi = (s + x * w) ** 2 + w**2 - sp.log(w**2) - 1
U = -(s + x * w)
# |ds/d eta| = eta/U; eta increases as s decreases.
dsdeta = -sp.sqrt(psi) / U
H = sp.sqrt(psi) / (U * w * sp.sqrt(K))
H1 = dsdeta * D(H)
H2 = dsdeta * D(H1)


def at_end(expr):
    e = expr.subs(sp.sqrt(psi), W).subs(psi, W**2)
    e = e.subs(w, r).subs(s, -(u + x * r))
    return sp.simplify(e)


H0e = at_end(H)
c1 = sp.simplify(at_end(H1) / H0e)
c2 = sp.simplify(at_end(H2) / (2 * H0e))

# First correction of the Laplace integral int g exp(-n f) dw, n = df/2,
# f = psi~, g = 1/w (the w^(-1) of the density), at its stationary point.
ww = sp.symbols("ww", positive=True)
sv = sp.symbols("sv", real=True)
f = (sv + x * ww) ** 2 + ww**2 - sp.log(ww**2)
g = 1 / ww
fk = [sp.diff(f, ww, k) for k in range(5)]
gk = [sp.diff(g, ww, k) for k in range(3)]
corr = (gk[2] / (2 * fk[2]) - g * fk[4] / (8 * fk[2] ** 2) - gk[1] * fk[3] / (2 * fk[2] ** 2)
        + 5 * g * fk[3] ** 2 / (24 * fk[2] ** 3)) / g
A = sp.simplify(2 * corr.subs(ww, r))

print("H0 =", sp.ccode(H0e))
print("c1 =", sp.ccode(c1))
print("c2 =", sp.ccode(c2))
print("A  =", sp.ccode(A))

fc1 = sp.lambdify((x, r, u, W), c1, "mpmath")
fc2 = sp.lambdify((x, r, u, W), c2, "mpmath")
fA = sp.lambdify((x, r), A, "mpmath")


def closed(t, df, delta):
    t, df, delta = mpmath.mpf(t), mpmath.mpf(df), mpmath.mpf(delta)
    xx, dd = t / mpmath.sqrt(df), delta / mpmath.sqrt(df)
    rr = (xx * dd + mpmath.sqrt(xx**2 * dd**2 + 4 * (1 + xx**2))) / (2 * (1 + xx**2))
    uu = dd - xx * rr
    WW = mpmath.sqrt(uu**2 + rr**2 - mpmath.log(rr**2) - 1)
    z = WW * mpmath.sqrt(df)
    Q, phi = mpmath.ncdf(-z), mpmath.npdf(z)
    inner = (Q + fc1(xx, rr, uu, WW) / mpmath.sqrt(df) * (phi - z * Q)
             + fc2(xx, rr, uu, WW) / df * ((1 + z**2) * Q - z * phi))
    a = df / 2
    const = 2 * mpmath.exp(a * mpmath.log(a) - a - mpmath.loggamma(a)) * mpmath.sqrt(2 * mpmath.pi / df)
    H0 = WW / (uu * rr * mpmath.sqrt(1 + xx**2 + 1 / rr**2))
    return const * H0 * (1 + fA(xx, rr) / df) * inner


def check():
    print("relative error of the closed form against the tail integral")
    for t, delta in [(-1.0, 1.0), (-3.0, 2.0), (-10.0, 5.0), (-0.5, 0.5), (-30.0, 10.0)]:
        prev = None
        for df in [10, 100, 1000, 10000, 100000, 1000000]:
            want = tail(mpmath.mpf(t), mpmath.mpf(df), mpmath.mpf(delta), False)
            got = closed(t, df, delta)
            e = abs(got / want - 1)
            slope = "" if prev is None else "  slope %.2f" % (mpmath.log10(e / prev))
            print("t=%6g delta=%5g df=%8g  rel.err %.3e%s" % (t, delta, df, float(e), slope))
            prev = e


if __name__ == "__main__":
    check()
