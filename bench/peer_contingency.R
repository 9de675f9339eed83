# Peer timings for bench/bench_contingency.cpp: R's chisq.test(correct = FALSE)
# (statistic, P-value, expected counts, Pearson and adjusted residuals) on the
# same square tables, plus fisher.test on the 2 x 2 one. Median of repeated
# batches (a batch runs the call `reps` times), in microseconds per call.
# Run: Rscript bench/peer_contingency.R
lcgTable <- function(n) {
  seed <- 12345
  v <- numeric(n * n)
  for (i in seq_len(n * n)) {
    seed <- (1664525 * seed + 1013904223) %% 4294967296
    v[i] <- floor(seed / 256) %% 21
  }
  matrix(v, n, n)  # column by column, as the library holds it
}
timeIt <- function(label, f, reps) {
  t <- replicate(5, system.time(for (i in seq_len(reps)) f())[["elapsed"]] / reps)
  cat(sprintf("%-40s %12.1f us\n", label, median(t) * 1e6))
}
for (n in c(2, 100, 1000)) {
  m <- lcgTable(n)
  reps <- if (n == 1000) 2 else if (n == 100) 100 else 5000
  timeIt(sprintf("chisq.test %dx%d", n, n), function() {
    r <- suppressWarnings(chisq.test(m, correct = FALSE))
    list(r$statistic, r$p.value, r$expected, r$residuals, r$stdres)
  }, reps)
}
m <- lcgTable(2)
timeIt("fisher.test 2x2", function() fisher.test(m)$p.value, 5000)
cat(sprintf("check: 100x100 X^2 = %.10g\n", suppressWarnings(chisq.test(lcgTable(100), correct = FALSE))$statistic))
