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

# Equivalence (TOST), factorial and one-way peers for bench/bench_power_tost.cpp.
tostPower <- function(n, d, lower = -1, upper = 1, sigma = 1, level = 0.05) {
  df <- 2 * n - 2
  se <- sigma * sqrt(2 / n)
  t <- qt(1 - level, df)
  max(pt(-t, df, ncp = (d - upper) / se) - pt(t, df, ncp = (d - lower) / se), 0)
}
timeIt("TOST power, qt + 2 pt (n 20, d 0.3)", function() tostPower(20, 0.3), 5000)
timeIt("TOST n, uniroot (d 0.3, power 0.8)", function()
  ceiling(uniroot(function(n) tostPower(n, 0.3) - 0.8, c(2, 1e6), tol = 1e-8)$root), 200)
timeIt("factorial power, qf + pf (1, 32 df)", function()
  1 - pf(qf(0.95, 1, 32), 1, 32, ncp = 48 * 0.25), 5000)
timeIt("power.anova.test n (4 groups)", function()
  power.anova.test(groups = 4, between.var = 0.1, within.var = 1, power = 0.8)$n, 200)
