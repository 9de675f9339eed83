# Peer timings for bench/bench_power.cpp: R's power.t.test and
# power.prop.test (strict = TRUE, default tolerance) on the same inputs, and
# range() over 1e7 values and over every other one of them. Median of
# repeated batches, in microseconds (milliseconds for the larger cases).
# Run: Rscript bench/peer_power.R
timeIt <- function(label, f, reps, unit = 1e6, name = "us") {
  t <- replicate(5, system.time(for (i in seq_len(reps)) f())[["elapsed"]] / reps)
  cat(sprintf("%-44s %10.2f %s\n", label, median(t) * unit, name))
}
timeIt("power.t.test two-sample power", function() power.t.test(n = 20, delta = 0.8, strict = TRUE), 2000)
timeIt("power.t.test n", function() power.t.test(delta = 0.5, power = 0.8, strict = TRUE), 500)
timeIt("power.t.test delta", function() power.t.test(n = 20, power = 0.8, strict = TRUE), 500)
timeIt("power.prop.test n", function() power.prop.test(p1 = 0.3, p2 = 0.5, power = 0.8, strict = TRUE), 1000)
effects <- 0.2 * (1:10)
powers <- 0.5 + 0.05 * (0:9)
timeIt("power.t.test n, 10 x 10", function() for (e in effects) for (p in powers)
  power.t.test(delta = e, power = p, strict = TRUE)$n, 5, 1e3, "ms")
# A uniform column like the benchmark's (range() does not depend on the
# values).
set.seed(12345)
x <- runif(1e7)
idx <- seq(1, 1e7, by = 2)
timeIt("range, 1e7 values", function() range(x), 10, 1e3, "ms")
timeIt("range(x[idx]), 5e6 of 1e7", function() range(x[idx]), 10, 1e3, "ms")
