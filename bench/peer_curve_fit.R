#!/usr/bin/env Rscript
# Peer timings for bench_curve_fit.cpp: R's cubic least squares on points of
# the same law (x uniform on [-2, 2), y a cubic plus uniform noise; R's
# generator, so not the same numbers). Elapsed seconds per call, the median
# of `reps` calls.
#   lm(y ~ poly(x, 3, raw = TRUE)) with summary(): the whole fit with R^2,
#     model frame and design built by R (LINPACK dqrdc2 Householder QR);
#   lm.fit(cbind(1, x, x^2, x^3), y): the least squares on a design built
#     beforehand.
# Run: Rscript bench/peer_curve_fit.R
set.seed(20261123)
timeIt <- function(label, f, reps) {
  times <- replicate(reps, system.time(f())[["elapsed"]])
  cat(sprintf("%-48s %8.1f ms  (median of %d)\n", label, 1000 * median(times), reps))
}
for (n in c(1e5, 1e6)) {
  x <- runif(n, -2, 2)
  y <- 1.5 + x * (-0.75 + x * (0.25 + 0.5 * x)) + runif(n) - 0.5
  X <- cbind(1, x, x^2, x^3)
  reps <- if (n < 1e6) 11 else 5
  timeIt(sprintf("lm(y ~ poly(x, 3, raw = TRUE)) + summary, n = %g", n),
         function() summary(lm(y ~ poly(x, 3, raw = TRUE)))$r.squared, reps)
  timeIt(sprintf("lm.fit(design, y), n = %g", n), function() lm.fit(X, y), reps)
}
