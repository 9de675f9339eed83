# Peer timings for bench/bench_gof_ticks.cpp: R's chisq.test(x, p = p) on
# k = 1e3, 1e6, 1e7 categories (unequal proportions, counts about 1000 per
# category), and pretty() on 1e5 random ranges (n = 5 and n = 50, the tick
# counts R aims at for maxTicks 11 and 100). Median of repeated batches.
# Run: Rscript bench/peer_gof_ticks.R
set.seed(2929)
timeIt <- function(label, f, reps, per = 1) {
  t <- replicate(3, system.time(for (i in seq_len(reps)) f())[["elapsed"]] / reps / per)
  cat(sprintf("%-36s %14.3f us\n", label, median(t) * 1e6))
}
for (k in c(1e3, 1e6, 1e7)) {
  p <- 0.5 + runif(k)
  p <- p / sum(p)
  x <- floor(p * 1e3 * k * (0.9 + 0.2 * runif(k)))
  reps <- if (k == 1e3) 2000 else if (k == 1e6) 5 else 1
  timeIt(sprintf("chisq.test k = %g", k), function() chisq.test(x, p = p)$p.value, reps)
}
n <- 1e5
mag <- 10^(-10 + 20 * runif(n)) * ifelse(runif(n) < 0.5, -1, 1)
lo <- mag * (0.05 + runif(n))
hi <- lo + abs(mag) * 10^(-3 + 3.5 * runif(n))
for (target in c(5, 50)) {
  timeIt(sprintf("pretty per range, n = %d", target),
         function() for (i in seq_len(n)) pretty(c(lo[i], hi[i]), n = target), 1, n)
}
