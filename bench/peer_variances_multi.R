#!/usr/bin/env Rscript
# Peer timings for bench_variances_multi.cpp: 10 samples of 1e6 uniform
# values with spreads growing by 5% a sample (R's generator, so not the same
# numbers). Elapsed seconds per call, the median of 3 calls:
#   bartlett.test, and Levene's test as anova(lm(|y - median| ~ g)).
# Run: Rscript bench/peer_variances_multi.R
set.seed(20261123)
k <- 10; n <- 1e6
g <- factor(rep(seq_len(k), each = n))
y <- unlist(lapply(seq_len(k), function(i) (1 + 0.05 * (i - 1)) * runif(n)))
timeIt <- function(label, f, reps = 3) {
  times <- replicate(reps, system.time(f())[["elapsed"]])
  cat(sprintf("%-44s %9.1f ms  (median of %d)\n", label, 1000 * median(times), reps))
}
timeIt("bartlett.test, 10 x 1e6", function() bartlett.test(y, g)$p.value)
timeIt("Levene anova(lm(|y - median| ~ g)), 10 x 1e6",
       function() anova(lm(abs(y - ave(y, g, FUN = median)) ~ g)))
