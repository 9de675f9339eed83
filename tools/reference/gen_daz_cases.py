#!/usr/bin/env python3
"""Reference values at points where the armed floating-point state (denormal
operands read as zero) once broke an exported distribution function: arguments
and locations near DBL_MIN, scales down to 1e-308, densities whose exponential
factor is a denormal while the density is not, and log-location laws whose
distance to the threshold is a denormal. The points came from a differential
sweep (tools/daz_sweep.cpp); the values are mpmath's at 50 digits, from the
exact doubles of the arguments.

Writes tests/data/daz_cases.csv with rows
    family,function,x,param1,param2,param3,param4,expected
(the layout of distribution_precision.csv).
Run: /usr/bin/python3 tools/reference/gen_daz_cases.py
"""
import os

import mpmath
from mpmath import mpf

mpmath.mp.dps = 50


def normal_pdf(x, m, s):
    z = (x - m) / s
    return mpmath.exp(-z * z / 2) / (s * mpmath.sqrt(2 * mpmath.pi))


def normal_lower(x, m, s):
    return mpmath.ncdf((x - m) / s)


def laplace_pdf(x, m, s):
    return mpmath.exp(-abs(x - m) / s) / (2 * s)


def exponential_pdf(x, s, t):
    return mpmath.exp(-(x - t) / s) / s


def logistic_pdf(x, m, s):
    e = mpmath.exp(-abs((x - m) / s))
    return e / (s * (1 + e) ** 2)


def lev_pdf(x, m, s):
    e = mpmath.exp(-(x - m) / s)
    return e * mpmath.exp(-e) / s


def sev_pdf(x, m, s):
    return lev_pdf(-x, -m, s)


def cauchy_pdf(x, m, s):
    z = (x - m) / s
    return 1 / (mpmath.pi * s * (1 + z * z))


def lognormal_pdf(x, m, s, t):
    return normal_pdf(mpmath.log(x - t), m, s) / (x - t)


def lognormal_lower(x, m, s, t):
    return normal_lower(mpmath.log(x - t), m, s)


def loglogistic_pdf(x, m, s, t):
    return logistic_pdf(mpmath.log(x - t), m, s) / (x - t)


def loglogistic_lower(x, m, s, t):
    return 1 / (1 + mpmath.exp(-(mpmath.log(x - t) - m) / s))


def halfnormal_inv(p, s, m):
    return m + s * mpmath.sqrt(2) * mpmath.erfinv(p)


def weibull_lower(x, k, s, t):
    return -mpmath.expm1(-((x - t) / s) ** k)


def weibull_upper(x, k, s, t):
    return mpmath.exp(-((x - t) / s) ** k)


def weibull_pdf(x, k, s, t):
    z = (x - t) / s
    return k / s * z ** (k - 1) * mpmath.exp(-z ** k)


def triangular_pdf(x, a, c, b):
    return 2 * (x - a) / ((b - a) * (c - a)) if x <= c else 2 * (b - x) / ((b - a) * (b - c))


def triangular_lower(x, a, c, b):
    return (x - a) ** 2 / ((b - a) * (c - a)) if x <= c else 1 - (b - x) ** 2 / ((b - a) * (b - c))


def gamma_pdf(x, a, s, t):
    z = (x - t) / s
    return z ** (a - 1) * mpmath.exp(-z) / (mpmath.gamma(a) * s)


def gamma_lower(x, a, s, t):
    return mpmath.gammainc(a, 0, (x - t) / s, regularized=True)


def lambda_q(p, lam):
    return (p ** lam - (1 - p) ** lam) / lam


def lambda_lower(x, lam, m, s):
    z = (x - m) / s
    return mpmath.findroot(lambda p: lambda_q(p, lam) - z, (mpf("0.01"), mpf("0.99")),
                           solver="anderson")


def lambda_pdf(x, lam, m, s):
    # The lower tail by bisection on ln p (p near DBL_MIN), then 1 / (s Q'(p)).
    z = (x - m) / s
    lo, hi = mpf(-1000000), mpf(0)
    for _ in range(400):
        mid = (lo + hi) / 2
        if lambda_q(mpmath.exp(mid), lam) < z:
            lo = mid
        else:
            hi = mid
    p = mpmath.exp(lo)
    return 1 / (s * (p ** (lam - 1) + (1 - p) ** (lam - 1)))


def lambda_inv(p, lam, m, s):
    return m + s * lambda_q(p, lam)


# family, function, evaluator, x, parameters
def t_pdf(x, n, delta):
    return (mpmath.gamma((n + 1) / 2) / (mpmath.sqrt(n * mpmath.pi) * mpmath.gamma(n / 2))
            * (1 + x * x / n) ** (-(n + 1) / 2))


def hyper_pmf(k, N, M, n):
    return mpmath.binomial(M, k) * mpmath.binomial(N - M, n - k) / mpmath.binomial(N, n)


def hyper_lower(k, N, M, n):
    return sum(hyper_pmf(mpf(j), N, M, n) for j in range(0, int(k) + 1))


def hyper_upper(k, N, M, n):
    return sum(hyper_pmf(mpf(j), N, M, n) for j in range(int(k), int(min(M, n)) + 1))


CASES = [
    # x halved to a denormal before the subtraction of the location
    ("Normal", "lower", normal_lower, 4.3379514771866341e-308, (0.0, 1.096993796349262e-298)),
    ("Normal", "lower", normal_lower, -3.6665897874029096e-308,
     (1.120413989552019e-304, 2.9569791300634717e-302)),
    ("Normal", "upper", lambda x, m, s: 1 - normal_lower(x, m, s), 4.0e-308, (0.0, 3.0e-305)),
    # x - location a denormal, scale near DBL_MIN
    ("Normal", "lower", normal_lower, 4.0e-308, (3.9e-308, 2.3e-308)),
    ("SmallestExtremeValue", "pdf", sev_pdf, -1.1376181283518934e-294,
     (-1.1376181283163249e-294, 5.0143706688366846e-308)),
    # exp(-t) a denormal, divided by a small scale
    ("Laplace", "pdf", laplace_pdf, -9.014199963962544e-304, (0.0, 1.2721752854561339e-306)),
    ("Laplace", "pdf", laplace_pdf, -2.2233965745892945e-300, (0.0, 1.9740314602501568e-303)),
    ("Exponential", "pdf", exponential_pdf, 4.5144877482144056e-298, (3.8889831614813891e-301, 0.0)),
    ("Logistic", "pdf", logistic_pdf, -1.2843551086717529e-302, (0.0, 1.8120887574329824e-305)),
    ("Logistic", "pdf", logistic_pdf, 7.3034999774010437e-304, (0.0, 6.3154274149650539e-307)),
    ("LargestExtremeValue", "pdf", lev_pdf, -4.9282638262636077e-302, (0.0, 7.5077001858134852e-303)),
    ("LargestExtremeValue", "pdf", lev_pdf, 4.6265555358582555e-303, (0.0, 3.9965980290138579e-306)),
    ("Normal", "pdf", normal_pdf, -6.750306385268893e-299,
     (-6.7502808319370141e-299, 6.7867230831814037e-306)),
    ("Normal", "pdf", normal_pdf, -6.9553140162554145e-123, (0.0, 1.8471440186719331e-124)),
    ("HalfNormal", "pdf", lambda x, s, m: 2 * normal_pdf(x, m, s), 3.85e-299, (1.0e-300, 0.0)),
    ("Cauchy", "pdf", cauchy_pdf, 1.0, (0.0, 1.5964408626741079e-156)),
    ("Cauchy", "pdf", cauchy_pdf, -1.0526400784889074e-149,
     (-1.544588230990011e-306, 2.7095703631517262e-308)),
    # log-location laws: the density's exponential a denormal, or x - threshold
    ("LogNormal", "pdf", lognormal_pdf, 2.4810362888284172e-209, (0.0, 12.768567959951023, 4.026860469853848e-300)),
    ("LogNormal", "lower", lognormal_lower, 3.0e-308, (-709.0, 3.0, 2.9e-308)),
    ("LogNormal", "pdf", lognormal_pdf, 3.0e-308, (-709.0, 3.0, 2.9e-308)),
    ("LogLogistic", "pdf", loglogistic_pdf, 1.0245245727225631e-296,
     (-6.4484979766699855e+294, 1.1990247826772936e+293, 0.0)),
    ("LogLogistic", "pdf", loglogistic_pdf, 1.4820997406370666e-134,
     (0.0, 0.43285941602240696, -1.679309491436181e-299)),
    ("LogLogistic", "pdf", loglogistic_pdf, 3.0e-308, (-709.0, 3.0, 2.9e-308)),
    ("LogLogistic", "lower", loglogistic_lower, 2.6953166358980291e-308,
     (-7.0063660239102738e-301, 174.73521805331941, 0.0)),
    ("LogLogistic", "lower", loglogistic_lower, 3.0e-308, (-709.0, 3.0, 2.9e-308)),
    # power laws at a standardized argument below DBL_MIN, or whose factors are
    ("Weibull", "lower", weibull_lower, 2.9558562842256503e-308,
     (0.025839829030722281, 1342986005.0040157, 0.0)),
    ("Weibull", "upper", weibull_upper, 1e-300, (0.01, 1e10, 0.0)),
    ("Weibull", "upper", weibull_upper, 3e-308, (0.01, 1.0, 2.9e-308)),
    ("Weibull", "pdf", weibull_pdf, 1.0, (2.8903478539817369e-20, 5.5147281529406885e-304, 0.0)),
    ("Weibull", "pdf", weibull_pdf, 1.0, (8.2313743433513721e-10, 1.5196236299203994e-305, 0.0)),
    ("Weibull", "pdf", weibull_pdf, 1e-300, (0.01, 1e10, 0.0)),
    ("Gamma", "lower", gamma_lower, 0.0, (4.2720075134275361e-09, 1.513105514636204e+293,
                                         -8.1012355155176444e-18)),
    ("Gamma", "lower", gamma_lower, 3e-308, (0.01, 1.0, 2.9e-308)),
    ("Gamma", "pdf", gamma_pdf, 7.240621110612097e-302, (47.241981546893363, 6.8828880326286284e-307,
                                                         7.2406211102104068e-302)),
    ("Gamma", "pdf", gamma_pdf, 4.0481675119277009e-308, (6.7336322488588599e-294,
                                                         6.9469279971557361e-292, 2.2764572926738004e-308)),
    ("Gamma", "pdf", gamma_pdf, 3e-308, (0.5, 1.0, 0.0)),
    ("ChiSq", "pdf", lambda x, df: gamma_pdf(x, df / 2, 2, 0), 2.712169407751571e-308,
     (2.2250738585072014e-308,)),
    ("ChiSq", "pdf", lambda x, df: gamma_pdf(x, df / 2, 2, 0), 0.5, (3.5007499691819397e-308,)),
    # triangles whose distances are denormals
    ("Triangular", "pdf", triangular_pdf, -4.4018151276262953e-303,
     (-4.401815127626904e-303, 0.0, 1.1493354733635594e-20)),
    ("Triangular", "lower", triangular_lower, -3.4363915345574147e-308,
     (-4.6284063013592482e-308, 0.0, 1e-300)),
    ("Triangular", "upper", lambda x, a, c, b: 1 - triangular_lower(x, a, c, b),
     6.0599557837086769e-305, (0.0, 1.7479912708957472e-306, 6.0602293716655037e-305)),
    # Weibull quantile at a shape near DBL_MIN: the power 1/shape times ln of
    # the exponential quantile is beyond the double range, the power is 0
    ("Weibull", "inv", lambda p, k, s, t: t + s * (-mpmath.log1p(-p)) ** (1 / k),
     5.3920304067076338e-308, (7.8545665011295746e-307, 3.896954887840462e-306, 3.7616079586972858e-301)),
    ("Weibull", "inv", lambda p, k, s, t: t + s * (-mpmath.log1p(-p)) ** (1 / k),
     0.5, (3.490743200181776e-307, 6.3941386039783052e-301, 7.1297464610297577e-18)),
    ("Weibull", "inv", lambda p, k, s, t: t + s * (-mpmath.log1p(-p)) ** (1 / k),
     1.0068950532784466e-306, (0.99373150737884608, 1.3616274618262274e+293, 0.0)),
    # Tukey's lambda near the logistic limit (cancellation of the two powers)
    ("Lambda", "lower", lambda_lower, 1e-20, (-5.7e-10, 0.0, 1.0)),
    ("Lambda", "lower", lambda_lower, 0.3, (-5.7e-10, 0.0, 1.0)),
    ("Lambda", "lower", lambda_lower, -2.0, (3e-7, 0.0, 1.0)),
    ("Lambda", "inv", lambda_inv, 0.7, (-5.7e-10, 0.0, 1.0)),
    ("Lambda", "pdf", lambda_pdf, -3.0235063223401205e-303,
     (5.9455461767232063e-05, 0.0, 4.3597161913404916e-306)),
    ("Lambda", "pdf", lambda_pdf, -7.9824253787397542e-293,
     (5.9091569057107785e-05, -3.2517227586458728e-293, 6.829449207653109e-296)),
    ("Lambda", "inv", lambda_inv, 0.5000001, (2e-5, 0.0, 1.0)),
    # half-normal quantile of p near DBL_MIN
    ("HalfNormal", "inv", halfnormal_inv, 2.3807828932272925e-308,
     (1.6047995271775233e+288, 3.1101496755184713e-292)),
    ("HalfNormal", "inv", halfnormal_inv, 3.0e-300, (1.0, 0.0)),
    ("HalfNormal", "inv", halfnormal_inv, 9.9e-9, (1.0, 0.0)),
    # Tukey lambda density whose lower tail is a denormal while a scale near
    # DBL_MIN keeps the density an ordinary number
    ("Lambda", "pdf", lambda_pdf, -4.87e-298, (0.001, 0.0, 1.0e-300)),
    ("Lambda", "pdf", lambda_pdf, -1.5306e-305, (0.001, 0.0, 3.0e-308)),
    ("Lambda", "pdf", lambda_pdf, -1.53e-305, (0.001, 0.0, 3.0e-308)),
    ("Lambda", "pdf", lambda_pdf, -1.0e-297, (-0.001, 0.0, 1.0e-300)),
    ("Lambda", "pdf", lambda_pdf, -9.5e-298, (-0.001, 0.0, 1.0e-300)),
    # central t density at a df whose half is subnormal
    ("T", "pdf", t_pdf, 1.0, (3.0e-308, 0.0)),
    ("T", "pdf", t_pdf, 1.0e-154, (3.0e-308, 0.0)),
    ("T", "pdf", t_pdf, 0.0, (1.0e-300, 0.0)),
    # supports of one point: an empty population, M = N, n = N (a trap
    # inside the mass formula once made these NaN)
    ("Hypergeometric", "pdf", hyper_pmf, 0.0, (0.0, 0.0, 0.0)),
    ("Hypergeometric", "lower", hyper_lower, 0.0, (0.0, 0.0, 0.0)),
    ("Hypergeometric", "upper", hyper_upper, 0.0, (0.0, 0.0, 0.0)),
    ("Hypergeometric", "pdf", hyper_pmf, 2.0, (5.0, 5.0, 2.0)),
    ("Hypergeometric", "upper", hyper_upper, 3.0, (7.0, 3.0, 7.0)),
]


def main():
    out = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data", "daz_cases.csv")
    with open(out, "w") as f:
        f.write("# family,function,x,param1,param2,param3,param4,expected\n")
        f.write("# generated by tools/reference/gen_daz_cases.py with mpmath %s\n"
                % mpmath.__version__)
        for family, function, evaluate, x, params in CASES:
            value = evaluate(mpf(x), *[mpf(p) for p in params])
            padded = list(params) + [0.0] * (4 - len(params))
            f.write("%s,%s,%r,%s,%s\n" % (family, function, x, ",".join(repr(p) for p in padded),
                                          mpmath.nstr(value, 20, min_fixed=0, max_fixed=0)))


if __name__ == "__main__":
    main()
