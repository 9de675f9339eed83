#!/usr/bin/env Rscript
# Reference ranks from R's rank() (a peer system, used as an oracle) for
# random columns with ties and missing cells, over all rows or a shuffled
# subset of rows. Per case, one line of ';'-separated fields:
#   values (NA for a missing cell); selected rows (1-based, in order);
#   then, for the selected rows in that order, eight rank vectors:
#   the missing cell ranked as the number 1.23456e30:
#     rank(x, "average"), rank(-x, "average"), rank(x, "first"), rank(-x, "last");
#   the missing cell left out (na.last = "keep"), the same four.
# Writes tests/data/ranks_r.txt.
set.seed(20261126)
out <- file("tests/data/ranks_r.txt", "w")
fmt <- function(v) paste(ifelse(is.na(v), "NA", sprintf("%.17g", v)), collapse = " ")
four <- function(x, keep) {
  na <- if (keep) "keep" else TRUE
  list(rank(x, ties.method = "average", na.last = na), rank(-x, ties.method = "average", na.last = na),
       rank(x, ties.method = "first", na.last = na), rank(-x, ties.method = "last", na.last = na))
}
for (case in 1:60) {
  n <- sample(1:40, 1)
  x <- sample(c(-2, -0.5, 0, 1, 1.5, 3, 1e10), n, replace = TRUE) + (case %% 3 == 0) * runif(n)
  x[runif(n) < 0.15] <- NA
  rows <- if (case %% 2 == 0) sample(seq_len(n), sample(seq_len(n), 1)) else seq_len(n)
  xs <- x[rows]
  filled <- ifelse(is.na(xs), 1.23456e30, xs)
  ranks <- c(four(filled, FALSE), four(xs, TRUE))
  writeLines(paste(c(fmt(x), fmt(rows), sapply(ranks, fmt)), collapse = ";"), out)
}
close(out)
