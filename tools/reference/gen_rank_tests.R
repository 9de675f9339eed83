# Reference values of the rank tests from R's wilcox.test and kruskal.test.
# Run: Rscript tools/reference/gen_rank_tests.R > tests/data/rank_tests_r.csv
#
# Rows: kind,case,numbers...
#   mw_x / mw_y / kw_g<i> : the data of a case
#   mw   : alternative(-1 less,0,1 greater), confidence, type(0 two-sided),
#          W (rank sum of x), P-value (continuity-corrected normal
#          approximation, variance adjusted for ties when there are ties),
#          ties(0/1), Hodges-Lehmann shift (median of all x - y),
#          lower, upper (the (N-k)-th and (k+1)-th smallest y - x, negated)
#   kw   : H adjusted for ties, degrees of freedom, P-value, ties(0/1)
options(digits = 17)
set.seed(20261123)
emitRow <- function(kind, case, v) cat(paste(c(kind, case, sprintf("%.17g", v)), collapse = ","), "\n", sep = "")

mwCase <- function(name, x, y, alt, conf) {
  emitRow("mw_x", name, x)
  emitRow("mw_y", name, y)
  altName <- c("less", "two.sided", "greater")[alt + 2]
  r <- wilcox.test(x, y, alternative = altName, exact = FALSE, correct = TRUE)
  n1 <- length(x); n2 <- length(y); N <- n1 * n2
  d <- sort(as.vector(outer(y, x, "-")))          # y - x, all of them
  sd <- sqrt((n1 + n2 + 1) * N / 12)
  k <- max(0, floor(N / 2 - 0.5 + qnorm((1 - conf) / 2) * sd))
  ties <- as.numeric(length(unique(c(x, y))) < n1 + n2)
  emitRow("mw", name, c(alt, conf, 0, unname(r$statistic) + n1 * (n1 + 1) / 2, r$p.value,
                        ties, median(-d), -d[N - k], -d[k + 1]))
}

mwCase("small", c(1.83, 0.50, 1.62, 2.48, 1.68, 1.88, 1.55, 3.06, 1.30),
       c(0.878, 0.647, 0.598, 2.05, 1.06, 1.29, 1.06, 3.14, 1.29), 0, 0.95)
mwCase("normal_greater", rnorm(40, 1), rnorm(33), 1, 0.9)
mwCase("normal_less", rnorm(25), rnorm(60, 0.3, 2), -1, 0.99)
mwCase("ties", round(rnorm(50, 0.5) * 2) / 2, round(rnorm(45) * 2) / 2, 0, 0.95)
mwCase("even_N", rexp(20), rexp(30, 2), 0, 0.8)
mwCase("large", rnorm(700, 0.1), rnorm(900), 0, 0.95)
# The two-sided continuity correction near the expectation: W = 11 against
# E(W) = 12, and W = E(W) exactly (no correction, P = 1); identical samples.
mwCase("below_expectation", c(1, 3.5, 5.5), c(2, 3, 4, 6), 0, 0.9)
mwCase("at_expectation", c(1, 3.5, 6.5), c(2, 3, 4, 6), 0, 0.9)
mwCase("identical", 1:5, 1:5, 0, 0.95)

kwCase <- function(name, groups) {
  for (i in seq_along(groups)) emitRow(paste0("kw_g", i), name, groups[[i]])
  r <- kruskal.test(groups)
  all <- unlist(groups)
  ties <- as.numeric(length(unique(all)) < length(all))
  emitRow("kw", name, c(unname(r$statistic), unname(r$parameter), r$p.value, ties))
}
kwCase("three", list(rnorm(10), rnorm(15, 0.8), rnorm(7, -0.3)))
kwCase("ties", list(round(rnorm(20)), round(rnorm(25, 0.5)), round(rnorm(18)), round(rnorm(9, 1))))
kwCase("two", list(rexp(30), rexp(41, 0.7)))

# Mood's median test from its definition: counts above the overall median
# against those at or below it, Pearson's chi-square without continuity
# correction. Group medians and Q3 - Q1 at positions (n + 1) p (type 6).
#   md   : overall median, chi-square, degrees of freedom, P-value
#   md_s<i> : group median, Q3 - Q1, count at or below, count above
moodCase <- function(name, groups) {
  for (i in seq_along(groups)) emitRow(paste0("md_g", i), name, groups[[i]])
  M <- median(unlist(groups))
  tab <- rbind(sapply(groups, function(g) sum(g <= M)), sapply(groups, function(g) sum(g > M)))
  r <- suppressWarnings(chisq.test(tab, correct = FALSE))
  emitRow("md", name, c(M, unname(r$statistic), unname(r$parameter), r$p.value))
  for (i in seq_along(groups)) {
    g <- groups[[i]]
    q <- quantile(g, c(0.25, 0.75), type = 6)
    emitRow(paste0("md_s", i), name, c(median(g), unname(q[2] - q[1]), sum(g <= M), sum(g > M)))
  }
}
moodCase("three", list(rnorm(12), rnorm(17, 1), rnorm(9, 0.5)))
moodCase("two", list(rexp(25), rexp(31, 0.5)))
moodCase("four", list(rnorm(30), rnorm(22, 0.2), rnorm(41, -0.4), rnorm(15)))

# Friedman's test: rows are blocks, columns treatments.
#   fr_t<i> : the column of treatment i
#   fr      : statistic (adjusted for ties when there are ties), degrees of
#             freedom, P-value, ties(0/1)
friedmanCase <- function(name, m) {
  for (i in seq_len(ncol(m))) emitRow(paste0("fr_t", i), name, m[, i])
  r <- friedman.test(m)
  ties <- as.numeric(any(apply(m, 1, function(b) length(unique(b)) < length(b))))
  emitRow("fr", name, c(unname(r$statistic), unname(r$parameter), r$p.value, ties))
}
friedmanCase("plain", matrix(rnorm(12 * 4) + rep(c(0, 0.5, 1, 0.2), each = 12), 12, 4))
friedmanCase("ties", matrix(round(rnorm(15 * 3) + rep(c(0, 0.7, 0.3), each = 15)), 15, 3))
friedmanCase("wide", matrix(rnorm(6 * 7), 6, 7))
