"""Studentized range upper tails by mpmath double integrals.

P(Q > q) = int_0^inf f(s) (1 - W_k(q s)) ds, with
W_k(w) = k int phi(z) (Phi(z) - Phi(z - w))^(k-1) dz and
f(s) = 2 (df/2)^(df/2) s^(df-1) exp(-df s^2/2) / Gamma(df/2).
The inner upper tail is integrated directly as
k int phi(z) [Phi(z)^(k-1) - (Phi(z) - Phi(z - w))^(k-1)] dz (no cancellation).
Writes tests/data/studentized_range_mp.csv: k, df, q, upper tail.
Run from the repository root: python3 tools/reference/gen_studentized_range.py
"""
from mpmath import mp, mpf, quad, npdf, ncdf, exp, log, loggamma, inf

mp.dps = 20


def w_upper(r, k):
    f = lambda z: npdf(z) * (ncdf(z) ** (k - 1) - (ncdf(z) - ncdf(z - r)) ** (k - 1))
    # z is the largest: its mass lies near r/2 for large r and near the mode
    # of the largest of k (about sqrt(2 log k)) for small r.
    cuts = sorted(set([-2, 0, 2, 4, r / 2, r, r + 2]))
    return k * quad(f, [-inf] + cuts + [inf])


def upper(q, k, df):
    c = log(2) + (df / 2) * log(df / 2) - loggamma(df / 2)
    f = lambda s: exp(c + (df - 1) * log(s) - df * s * s / 2) * w_upper(q * s, k)
    # The chi density peaks at s = 1 with width 1/sqrt(2 df): cut around it.
    near = [1 + j * mpf(0.7) / mp.sqrt(df) for j in range(-5, 6)]
    cuts = sorted(set([mpf(0), 1 / q, 2 / q, 4 / q, 8 / q, mpf(1) / 2, mpf(2), mpf(4)] +
                      [s for s in near if s > 0]))
    return quad(f, cuts + [inf])


# Each point takes minutes (k = 100 at df = 1000 about an hour) at 20
# digits; the far tails at small df, a larger k at moderate df, k = 100 at
# df = 1000 near P = 0.001, non-integer df (10.5, and 0.5 at q = 1e6 where
# the tail is a power of q).
POINTS = [(3, 2, 19.0155), (3, 2, 42.4129), (3, 3, 23.7037), (5, 2, 25.372), (5, 5, 13.9313),
          (10, 3, 16.7134), (20, 30, 5.5), (100, 1000, 7.3622), (40, 10.5, 9.0162),
          (3, 0.5, 1e6)]

if __name__ == "__main__":
    with open("tests/data/studentized_range_mp.csv", "w") as out:
        out.write("# From tools/reference/gen_studentized_range.py (mpmath, 20 digits).\n# k,df,q,upper\n")
        for k, df, q in POINTS:
            p = upper(mpf(q), k, mpf(df))
            out.write("%d,%s,%s,%s\n" % (k, df, q, mp.nstr(p, 17)))
            out.flush()
