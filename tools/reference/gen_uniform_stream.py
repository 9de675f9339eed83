#!/usr/bin/env python3
"""Reference streams of the combined congruential uniform generator.

The generator has three prime-modulus streams
    x1 <- 157 x1 mod 32363, x2 <- 146 x2 mod 31727, x3 <- 142 x3 mod 31657
and a draw is frac(x1/32363.0 + x2/31727.0 + x3/31657.0), summed left to right
in IEEE doubles. A seed (a double) names the state by mixed-radix digits:
with M1, M2, M3 = 32362, 31726, 31656 and b = fmod(|seed|, M1 M2 M3),
    x1 = trunc(b / (M2 M3)) + 1, x2 = trunc(fmod(b / M3, M2)) + 1,
    x3 = trunc(fmod(b, M3)) + 1.

Python floats are IEEE doubles with correctly rounded division and addition,
and math.fmod / math.modf are exact, so the double route here reproduces the
library's arithmetic bit for bit without sharing any of its code. Two
independent checks guard this script itself:
  * for integer seeds below 2**53 the double seeding route is compared with
    exact integer mixed-radix digits (divmod);
  * every draw is compared with the exact rational fraction (fractions module)
    and must lie within a few units in the last place of it.
It also verifies the stream structure: each multiplier is a primitive root of
its prime modulus, and the combined period is lcm of the three periods.

Writes tests/data/uniform_stream.csv with rows
    stream,seed,x1,x2,x3,base,v1,...,vN   (state after seeding, first N draws)
    deep,seed,k,value_k,base_after_k      (the k-th draw, k counted from 1)
    chisq,df,alpha,critical               (upper alpha point of chi-square(df),
                                           from scipy, for the bucket tests)
Run: /usr/bin/python3 tools/reference/gen_uniform_stream.py
"""
import math
import os
from fractions import Fraction

from scipy.stats import chi2

OUT = os.path.join(os.path.dirname(__file__), "..", "..", "tests", "data", "uniform_stream.csv")

MULTIPLIERS = (157, 146, 142)
MODULI = (32363, 31727, 31657)
M1, M2, M3 = (m - 1 for m in MODULI)
SPACE = M1 * M2 * M3

FIRST_DRAWS = 400
DEEP = (1000, 100000, 1000000)

SEEDS = [
    1.0,                      # states (1, 1, 2)
    -1.0,                     # sign is dropped
    12345.0,
    0.5,                      # fractions vanish: (1, 1, 1)
    1e-300,
    float(SPACE),             # reduces to 0: (1, 1, 1)
    float(SPACE - 1),         # the largest state (32362, 31726, 31656)
    float(M2 * M3),           # first digit steps: (2, 1, 1)
    float(M3),                # second digit steps: (1, 2, 1)
    float(3 * SPACE + 987654321),
    123456789.987,            # fractional, mid-range
    -7.25,
    17900000000000000.0,      # the size of a clock seed (seconds * 1e7)
    1e300,                    # reduction of a huge base
]


def is_prime(n):
    return n > 1 and all(n % d for d in range(2, math.isqrt(n) + 1))


def prime_factors(n):
    out, d = set(), 2
    while d * d <= n:
        while n % d == 0:
            out.add(d)
            n //= d
        d += 1
    if n > 1:
        out.add(n)
    return out


def check_structure():
    for a, p in zip(MULTIPLIERS, MODULI):
        assert is_prime(p), p
        # a is a primitive root iff a^((p-1)/q) != 1 for every prime q | p-1
        assert all(pow(a, (p - 1) // q, p) != 1 for q in prime_factors(p - 1)), (a, p)
    period = math.lcm(M1, M2, M3)
    assert period == 8125436850168 and SPACE == 32501747400672 and SPACE == 4 * period


def seed_double(seed):
    """The seeding steps in IEEE double arithmetic."""
    b = math.fmod(abs(seed), float(SPACE))
    return (int(b / float(M2 * M3)) + 1,
            int(math.fmod(b / float(M3), float(M2))) + 1,
            int(math.fmod(b, float(M3))) + 1)


def seed_exact(n):
    """Mixed-radix digits of an integer seed, in exact integer arithmetic."""
    n = abs(n) % SPACE
    first, rest = divmod(n, M2 * M3)
    second, third = divmod(rest, M3)
    return first + 1, second + 1, third + 1


def base_of(state):
    x1, x2, x3 = state
    return (x3 - 1) + M3 * ((x2 - 1) + M2 * (x1 - 1))


def step(state):
    return tuple(x * a % p for x, a, p in zip(state, MULTIPLIERS, MODULI))


def draw(state):
    x1, x2, x3 = state
    s = x1 / float(MODULI[0]) + x2 / float(MODULI[1]) + x3 / float(MODULI[2])
    value = math.modf(s)[0]
    exact = sum(Fraction(x, p) for x, p in zip(state, MODULI))
    exact -= math.floor(exact)
    # three roundings of terms below 3: the double lies within 4 ulp(2) of the
    # exact fraction
    assert abs(Fraction(value) - exact) <= 4 * Fraction(2) ** -51, state
    assert 0.0 <= value < 1.0
    return value


def stream(seed):
    state = seed_double(seed)
    if seed == int(seed) and abs(seed) < 2 ** 53:
        assert state == seed_exact(int(seed)), seed
    if seed == int(seed) and abs(seed) < SPACE:
        assert base_of(state) == abs(int(seed))
    return state


def main():
    check_structure()
    assert seed_double(1.0) == (1, 1, 2)
    assert seed_double(0.5) == (1, 1, 1) and seed_double(float(SPACE)) == (1, 1, 1)
    rows = []
    deep_rows = []
    for seed in SEEDS:
        state = stream(seed)
        start = state
        values = []
        for _ in range(FIRST_DRAWS):
            state = step(state)
            values.append(draw(state))
        rows.append(["stream", repr(seed)] + [str(x) for x in start] +
                    [repr(float(base_of(start)))] + [repr(v) for v in values])
    for seed in (1.0, 12345.0, 17900000000000000.0):
        state = stream(seed)
        k = 0
        for target in DEEP:
            while k < target:
                state = step(state)
                k += 1
            deep_rows.append(["deep", repr(seed), str(k), repr(draw(state)),
                              repr(float(base_of(state)))])
    # 100 buckets, and 10 x 10 buckets of successive pairs: 99 degrees of freedom
    critical = ["chisq", "99", "0.0001", repr(float(chi2.isf(1e-4, 99)))]
    with open(OUT, "w") as out:
        out.write("# stream,seed,x1,x2,x3,base,first %d draws | deep,seed,k,k-th draw,base\n"
                  % FIRST_DRAWS)
        out.write("# generated by tools/reference/gen_uniform_stream.py\n")
        for row in rows + deep_rows + [critical]:
            out.write(",".join(row) + "\n")


if __name__ == "__main__":
    main()
