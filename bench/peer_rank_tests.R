#!/usr/bin/env Rscript
# Peer timings for bench_rank_tests.cpp: R's own rank tests on samples of the
# same sizes and laws (normal, the same shifts; R's generator, so not the
# same numbers). Elapsed seconds per call, the median of `reps` calls.
#   wilcox.test(x, y, conf.int = TRUE, exact = FALSE)  Mann-Whitney with the
#     Hodges-Lehmann shift and interval (R finds them by root search on the
#     normal approximation, ranking the pooled sample at every step);
#   kruskal.test on 1e7 observations in 10 groups (R is single-threaded);
#   wilcox.test(x, conf.int = TRUE, exact = FALSE)  signed rank test;
#   binom.test on the counts (the sign test; R has no sign interval).
# Run: Rscript bench/peer_rank_tests.R [largest Mann-Whitney n, default 1e6]
args <- commandArgs(trailingOnly = TRUE)
largest <- if (length(args) > 0) as.numeric(args[1]) else 1e6
set.seed(20261123)

timeIt <- function(label, f, reps) {
  times <- replicate(reps, system.time(f())[["elapsed"]])
  cat(sprintf("%-44s %10.3f s  (median of %d)\n", label, median(times), reps))
  flush.console()
}

for (n in c(1e4, 1e5, 1e6)) {
  if (n > largest) {
    cat(sprintf("wilcox.test two-sample conf.int, n = %g    skipped\n", n))
    next
  }
  x <- rnorm(n, 0.2); y <- rnorm(n)
  reps <- if (n < 1e6) 3 else 1
  timeIt(sprintf("wilcox.test two-sample conf.int, n = %g", n),
         function() wilcox.test(x, y, conf.int = TRUE, exact = FALSE), reps)
}

g <- rep(1:10, each = 1e6)
v <- rnorm(1e7, 0.1 * (g - 1))
timeIt("kruskal.test, 1e7 in 10 groups", function() kruskal.test(v, g), 1)
rm(g, v)

z <- rnorm(1e6, 0.01)
timeIt("wilcox.test one-sample conf.int, n = 1e6",
       function() wilcox.test(z, conf.int = TRUE, exact = FALSE), 1)
timeIt("sign test (binom.test on counts), n = 1e6",
       function() binom.test(sum(z > 0), sum(z != 0)), 3)
