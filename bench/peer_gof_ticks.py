#!/usr/bin/env python3
"""Peer timings for bench/bench_gof_ticks.cpp: SciPy's chisquare(f_obs,
f_exp) on k = 1e3, 1e6, 1e7 categories of the same shape. Needs SciPy.
Run: python3 bench/peer_gof_ticks.py"""
import time

import numpy as np
from scipy.stats import chisquare

rng = np.random.default_rng(2929)
for k in (10**3, 10**6, 10**7):
    p = 0.5 + rng.random(k)
    p /= p.sum()
    x = np.floor(p * 1e3 * k * (0.9 + 0.2 * rng.random(k)))
    reps = 200 if k == 10**3 else 3
    times = []
    for _ in range(3):
        t0 = time.perf_counter()
        for _ in range(reps):
            chisquare(x, p * x.sum())
        times.append((time.perf_counter() - t0) / reps)
    print("chisquare k = %g  %.3f ms" % (k, sorted(times)[1] * 1e3))
