#!/usr/bin/env Rscript
# Peer timings for bench_proportions_variances.cpp, in R: binom.test
# (Clopper-Pearson interval and exact test), prop.test (Wilson score interval
# and test) at n = 1e2, 1e4, 1e6 with x = 0.3 n; var.test and the pooled t
# test on absolute deviations from the median at n1 = n2 = 1e6 (R is
# single-threaded). Elapsed time per call, the median of repeated batches.
# Run: Rscript bench/peer_proportions_variances.R
set.seed(20261123)
timeIt <- function(label, f, calls, reps = 5) {
  times <- replicate(reps, system.time(for (i in seq_len(calls)) f())[["elapsed"]] / calls)
  cat(sprintf("%-52s %12.1f us\n", label, 1e6 * median(times)))
}
for (n in c(1e2, 1e4, 1e6)) {
  x <- floor(0.3 * n)
  # The two-sided binom.test P-value sums the masses of all n + 1 outcomes.
  calls <- if (n < 1e6) 500 else 20
  timeIt(sprintf("binom.test interval + test, n = %g", n),
         function() binom.test(x, n, 0.31), calls)
  timeIt(sprintf("prop.test (Wilson) interval + test, n = %g", n),
         function() prop.test(x, n, 0.31, correct = FALSE), 500)
}
x <- rnorm(1e6); y <- rnorm(1e6, 0, 1.05)
timeIt("var.test, n1 = n2 = 1e6", function() var.test(x, y), 3, 3)
timeIt("var.test + t on |x - median|, n1 = n2 = 1e6", function() {
  var.test(x, y)
  t.test(abs(x - median(x)), abs(y - median(y)), var.equal = TRUE)
}, 3, 3)
