#!/usr/bin/env Rscript
# Peer timings for bench_grouping.cpp, on the columns that benchmark writes
# (/tmp/qel_grouping_columns.bin or the path given): 1e7 rows of a column of
# 100 distinct values and one of 1000. Elapsed seconds, median of 3 calls.
#   order(a) and order(a, b) with run detection: the groups in sorted order;
#   data.table (one thread, as the library): the row numbers of each group,
#   keyed (sorted) by the grouping columns.
# Run: Rscript bench/peer_grouping.R [columns file]
args <- commandArgs(trailingOnly = TRUE)
path <- if (length(args) > 0) args[1] else "/tmp/qel_grouping_columns.bin"
n <- 1e7
con <- file(path, "rb")
hundred <- readBin(con, "double", n)
thousand <- readBin(con, "double", n)
close(con)
stopifnot(length(thousand) == n)

timeIt <- function(label, f, reps = 3) {
  times <- replicate(reps, system.time(f())[["elapsed"]])
  cat(sprintf("%-46s %8.3f s  (median of %d)\n", label, median(times), reps))
}

runs <- function(o, ...) {
  cols <- lapply(list(...), function(x) x[o])
  change <- Reduce(`|`, lapply(cols, function(s) s[-1] != s[-length(s)]))
  split(o, cumsum(c(TRUE, change)))
}

timeIt("order(a) + runs, 1000 values", function() runs(order(thousand), thousand))
timeIt("order(a, b) + runs, 100 x 1000", function() runs(order(hundred, thousand), hundred, thousand))
timeIt("order(a, b) alone, 100 x 1000", function() order(hundred, thousand))
if (requireNamespace("data.table", quietly = TRUE)) {
  library(data.table)
  setDTthreads(1)
  dt <- data.table(a = hundred, b = thousand)
  timeIt("data.table keyby a, 1000 values, .I", function() dt[, .(rows = list(.I)), keyby = b])
  timeIt("data.table keyby a, b, 100 x 1000, .I", function() dt[, .(rows = list(.I)), keyby = .(a, b)])
} else {
  cat("data.table not installed: skipped\n")
}
