#!/usr/bin/env python3
"""Reference values of the hostile-argument regression cases, from mpmath.

Writes tests/data/hostile_cases.csv: name,value (17 significant digits).
Run: python3 tools/reference/gen_hostile_cases.py
"""
import os
from fractions import Fraction

from mpmath import mp, mpf, binomial, exp, expm1, findroot

mp.dps = 40
ROOT = os.path.normpath(os.path.join(os.path.dirname(__file__), "..", ".."))


def lambda_root(lam, z):
    q = lambda p: (p ** lam - (1 - p) ** lam) / lam - z
    return findroot(q, (mpf("0.5"), mpf("0.999999")), solver="anderson")


def cases():
    out = {}
    out["exponential_cdf_1e-300"] = -expm1(-mpf("1e-300"))
    out["integeruniform_cdf_wide"] = mpf(2 + 2147483647 + 1) / (5 + 2147483647 + 1)
    out["integeruniform_pdf_wide"] = mpf(1) / (2147483647 + 2147483647 + 1)
    out["hypergeometric_pdf_intmax"] = binomial(2147483644, 3) / binomial(2147483647, 3)
    p = lambda_root(mpf("-0.5"), mpf(1))
    out["lambda_cdf_negative"] = p
    out["lambda_pdf_negative"] = 1 / (p ** mpf("-1.5") + (1 - p) ** mpf("-1.5"))
    # Tukey lambda at lambda 0 is the logistic law; density at 0 with scale 2.
    out["lambda_pdf_logistic_scale2"] = mpf(1) / 4 / 2
    out["poisson_upper_2.5"] = 1 - exp(-3) * (1 + 3 + mpf(9) / 2)
    out["geometric_upper_2.5"] = mpf("0.7") ** 2
    # Trials form: X >= 5 means fewer than 2 successes in the first 4 trials.
    q = mpf("0.7")
    out["negbinomial_upper_4.5"] = q ** 4 + 4 * mpf("0.3") * q ** 3
    out["hypergeometric_upper_1.5"] = sum(binomial(4, k) * binomial(6, 5 - k)
                                          for k in range(2, 5)) / binomial(10, 5)
    # Sample excess kurtosis (the adjusted G2) of 0, 1, ..., n - 1, exactly:
    # M2 = n(n^2 - 1)/12 and M4 = n(n^2 - 1)(3n^2 - 7)/240.
    for n in (1000000,):
        m2 = Fraction(n * (n * n - 1), 12)
        m4 = Fraction(n * (n * n - 1) * (3 * n * n - 7), 240)
        g2 = (Fraction(n - 1, (n - 2) * (n - 3)) *
              (n * (n + 1) * m4 / (m2 * m2) - 3 * (n - 1)))
        out[f"kurtosis_grid_{n}"] = mpf(g2.numerator) / g2.denominator
    return out


def main():
    path = os.path.join(ROOT, "tests", "data", "hostile_cases.csv")
    with open(path, "w") as f:
        f.write("name,value\n")
        for name, value in cases().items():
            f.write(f"{name},{mp.nstr(value, 17, min_fixed=-5, max_fixed=-5)}\n")
    print("wrote", path)


if __name__ == "__main__":
    main()
