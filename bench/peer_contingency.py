# Peer timings for bench/bench_contingency.cpp: SciPy's chi2_contingency
# (correction=False: statistic, P-value, degrees of freedom, expected counts),
# the same with lambda_="log-likelihood" (the G test), and somersd on the
# table (concordant and discordant pairs, Somers' d and its P-value), on the
# same square tables. Median of 5 batches, microseconds per call. somersd
# takes 0.18 s on 100 x 100 and grows as (rc)^2, so it is not run on
# 1000 x 1000 (it would take about half an hour).
# Run: /usr/bin/python3 bench/peer_contingency.py
import time

import numpy as np
from scipy.stats import chi2_contingency, fisher_exact, somersd


def lcg_table(n):
    seed = 12345
    v = np.empty(n * n)
    for i in range(n * n):
        seed = (1664525 * seed + 1013904223) % 4294967296
        v[i] = (seed >> 8) % 21
    return v.reshape(n, n).T  # column by column, as the library holds it


def time_it(label, f, reps):
    batches = []
    for _ in range(5):
        start = time.perf_counter()
        for _ in range(reps):
            f()
        batches.append((time.perf_counter() - start) / reps)
    print(f"{label:40s} {np.median(batches) * 1e6:12.1f} us")


for n, reps in ((2, 2000), (100, 100), (1000, 2)):
    m = lcg_table(n)
    time_it(f"chi2_contingency {n}x{n}", lambda: chi2_contingency(m, correction=False), reps)
    time_it(f"chi2_contingency G {n}x{n}",
            lambda: chi2_contingency(m, correction=False, lambda_="log-likelihood"), reps)
    if n <= 100:
        time_it(f"somersd {n}x{n}", lambda: somersd(m), reps)
m = lcg_table(2)
time_it("fisher_exact 2x2", lambda: fisher_exact(m), 2000)
