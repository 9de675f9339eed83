# Reference values of the contingency table statistics, from R and from direct
# evaluation of the textbook formulas.
# Run: Rscript tools/reference/gen_contingency_r.R > tests/data/contingency_r.csv
#
# A table m has R rows and C columns; its values are written column by column
# (as.vector(m)), which is the library's layout: column c, then row r.
# Rows: kind,case,numbers...
#   table    : C, R, the counts column by column
#   chisq    : chisq.test(correct = FALSE): statistic, df, P-value (on the
#              table without its empty rows and columns)
#   expected : expected counts, column by column (NaN in empty rows/columns)
#   resid    : Pearson residuals (o - e) / sqrt(e)
#   stdres   : adjusted (standardized) residuals of chisq.test
#   gtest    : G = 2 sum o log(o / e), df, upper chi-square P-value
#   cor      : cor() and cor(method = "spearman") on the expanded data, with
#              the 0-based level indices as values
#   fisher   : fisher.test two-sided P-value (2 x 2 only)
#   mcnemar  : for b = m[1, 2], c = m[2, 1]: binom.test(min(b, c), b + c)
#              P-value, and (b - c) / N with its bounds (b - c)/N -+
#              (qnorm(0.975) sqrt(b + c - (b - c)^2 / N) + 1) / N
#   kappa    : marks, then kappa (see kappaCase)
#   gk       : Goodman-Kruskal lambda(row|col), lambda(col|row), tau(row|col),
#              tau(col|row), by their definitions
#   conc     : concordant, discordant, tied, all pairs (by the double sum over
#              cell pairs), Somers d(row|col), d(col|row), gamma, tau-b, and
#              the upper-tail normal P-value of the z statistic
#   kendall  : cor(method = "kendall") on the expanded data (tau-b), small
#              tables only
#   pct      : percentages of the column totals, of the row totals and of N,
#              each cell by cell column by column
#   margins  : column totals, row totals, N, and the column and row totals
#              as percentages of N
#   mh_stratum / mh : strata of 2 x 2 tables (a, b, c, d column by column),
#              then mantelhaen.test(correct = TRUE): common odds ratio,
#              statistic, P-value, df
options(digits = 17)
set.seed(20261123)
emitRow <- function(kind, case, v) {
  v[is.na(v)] <- NaN
  cat(paste(c(kind, case, sprintf("%.17g", v)), collapse = ","), "\n", sep = "")
}

expand <- function(m) {
  idx <- which(m > 0, arr.ind = TRUE)
  w <- m[idx]
  list(row = rep(idx[, 1] - 1, w), col = rep(idx[, 2] - 1, w))
}

pairCounts <- function(m) {
  R <- nrow(m); C <- ncol(m); P <- 0; Q <- 0
  for (i in seq_len(R)) for (j in seq_len(C)) {
    if (i < R && j < C) P <- P + m[i, j] * sum(m[(i + 1):R, (j + 1):C])
    if (i > 1 && j < C) Q <- Q + m[i, j] * sum(m[1:(i - 1), (j + 1):C])
  }
  c(P, Q)
}

tableCase <- function(name, m, integerCounts = TRUE) {
  emitRow("table", name, c(ncol(m), nrow(m), as.vector(m)))
  rs <- rowSums(m); cs <- colSums(m); N <- sum(m)
  keepR <- rs > 0; keepC <- cs > 0
  emitRow("pct", name, c(100 * sweep(m, 2, cs, "/"), 100 * sweep(m, 1, rs, "/"), 100 * m / N))
  emitRow("margins", name, c(cs, rs, N, 100 * cs / N, 100 * rs / N))
  reduced <- m[keepR, keepC, drop = FALSE]
  # With one row or column left, chisq.test would test goodness of fit to
  # equal proportions, another test: such tables are checked by hand.
  if (nrow(reduced) >= 2 && ncol(reduced) >= 2) chiSquareRows(name, m, reduced, keepR, keepC)
  if (integerCounts) {
    x <- expand(m)
    emitRow("cor", name, suppressWarnings(c(cor(x$col, x$row),
                                            cor(x$col, x$row, method = "spearman"))))
    if (N <= 3000) emitRow("kendall", name, suppressWarnings(cor(x$col, x$row, method = "kendall")))
  }
  measureRows(name, m)
}

chiSquareRows <- function(name, m, reduced, keepR, keepC) {
  r <- suppressWarnings(chisq.test(reduced, correct = FALSE))
  full <- function(v) { out <- matrix(NaN, nrow(m), ncol(m)); out[keepR, keepC] <- v; as.vector(out) }
  emitRow("chisq", name, c(unname(r$statistic), unname(r$parameter), r$p.value))
  emitRow("expected", name, full(r$expected))
  emitRow("resid", name, full(r$residuals))
  emitRow("stdres", name, full(r$stdres))
  e <- r$expected; o <- reduced
  G <- 2 * sum(ifelse(o > 0, o * log(o / e), 0))
  df <- unname(r$parameter)
  emitRow("gtest", name, c(G, df, pchisq(G, df, lower.tail = FALSE)))
}

measureRows <- function(name, m) {
  rs <- rowSums(m); cs <- colSums(m); N <- sum(m)
  # Goodman and Kruskal, from the definitions: errors of the modal guess
  # (lambda) and of the proportional guess (tau) without and with the
  # other variable.
  lambdaRow <- (sum(apply(m, 2, max)) - max(rs)) / (N - max(rs))
  lambdaCol <- (sum(apply(m, 1, max)) - max(cs)) / (N - max(cs))
  errRow <- N - sum(rs^2) / N
  errRowGivenCol <- sum(sapply(which(cs > 0), function(j) cs[j] - sum(m[, j]^2) / cs[j]))
  errCol <- N - sum(cs^2) / N
  errColGivenRow <- sum(sapply(which(rs > 0), function(i) rs[i] - sum(m[i, ]^2) / rs[i]))
  emitRow("gk", name, c(lambdaRow, lambdaCol, (errRow - errRowGivenCol) / errRow,
                        (errCol - errColGivenRow) / errCol))
  pq <- pairCounts(m); P <- pq[1]; Q <- pq[2]
  pairs <- N * (N - 1) / 2
  notTiedCol <- pairs - sum(cs * (cs - 1) / 2)
  notTiedRow <- pairs - sum(rs * (rs - 1) / 2)
  z <- (P - Q) / sqrt((N^3 - sum(rs^3)) * (N^3 - sum(cs^3)) / (9 * N^3))
  emitRow("conc", name, c(P, Q, pairs - P - Q, pairs, (P - Q) / notTiedCol, (P - Q) / notTiedRow,
                          (P - Q) / (P + Q), (P - Q) / sqrt(notTiedCol * notTiedRow),
                          pnorm(z, lower.tail = FALSE)))
  if (nrow(m) == 2 && ncol(m) == 2) {
    emitRow("fisher", name, fisher.test(m)$p.value)
    b <- m[1, 2]; cc <- m[2, 1]
    est <- (b - cc) / N
    w <- (qnorm(0.975) * sqrt(b + cc - (b - cc)^2 / N) + 1) / N
    p <- if (b + cc > 0) binom.test(min(b, cc), b + cc)$p.value else 1
    emitRow("mcnemar", name, c(est, est - w, est + w, p))
  }
}

# Cohen's kappa over the levels that the two margins share: the columns and
# rows carry level names, the marks walk the sorted union of the names (0 a
# shared level, -1 a level of the rows only, 1 of the columns only).
kappaCase <- function(name, m, colLevels, rowLevels) {
  tableCase(name, m)
  all <- sort(union(colLevels, rowLevels))
  marks <- ifelse(all %in% colLevels & all %in% rowLevels, 0,
                  ifelse(all %in% rowLevels, -1, 1))
  shared <- intersect(colLevels, rowLevels)
  N <- sum(m); rs <- rowSums(m); cs <- colSums(m)
  agree <- sum(sapply(shared, function(l) m[match(l, rowLevels), match(l, colLevels)]))
  chance <- sum(sapply(shared, function(l) rs[match(l, rowLevels)] * cs[match(l, colLevels)]))
  p0 <- agree / N; pe <- chance / N^2
  emitRow("kappa", name, c(marks, (p0 - pe) / (1 - pe)))
}

tableCase("small2x2", matrix(c(12, 3, 5, 9), 2, 2))
tableCase("tea2x2", matrix(c(3, 1, 1, 3), 2, 2))
tableCase("small3x4", matrix(c(20, 15, 30, 25, 10, 8, 12, 30, 20, 9, 14, 11), 3, 4))
sparse <- matrix(0, 6, 5)
sparse[cbind(c(1, 2, 2, 4, 5, 6, 6, 1), c(1, 1, 3, 3, 4, 5, 1, 4))] <- c(3, 1, 4, 2, 7, 1, 2, 1)
tableCase("sparse_empty_row_col", sparse)  # row 3 and column 2 are empty
tableCase("large40x30", matrix(rpois(40 * 30, 6), 40, 30))
tableCase("unbalanced", matrix(c(100000, 2, 1, 3, 5, 0, 1, 0, 4), 3, 3))
tableCase("unbalanced2x2", matrix(c(25000, 3, 7, 1), 2, 2))
tableCase("ordered5x4", matrix(c(30, 12, 5, 2, 1, 10, 25, 14, 6, 2, 3, 9, 22, 17, 8, 1, 2, 8, 19, 28), 5, 4))
tableCase("noninteger", matrix(c(2.5, 7.25, 1.5, 4.75, 3.5, 6.125), 2, 3), integerCounts = FALSE)
tableCase("row1x4", matrix(c(5, 3, 8, 2), 1, 4))
kappaCase("perfect2x2", matrix(c(10, 0, 0, 10), 2, 2), c("a", "b"), c("a", "b"))
kappaCase("kappa_square", matrix(c(40, 5, 3, 6, 30, 4, 2, 7, 25), 3, 3), c("a", "b", "c"), c("a", "b", "c"))
kappaCase("kappa_offset", matrix(c(22, 4, 3, 5, 18, 2, 1, 6, 15, 3, 2, 9), 3, 4),
          c("a", "b", "d", "e"), c("a", "c", "d"))

mhCase <- function(name, strata) {
  for (k in seq_along(strata)) emitRow("mh_stratum", name, c(k, as.vector(strata[[k]])))
  x <- array(unlist(strata), c(2, 2, length(strata)))
  r <- mantelhaen.test(x, correct = TRUE)
  emitRow("mh", name, c(unname(r$estimate), unname(r$statistic), r$p.value, unname(r$parameter)))
}
mhCase("three_strata", list(matrix(c(0, 0, 6, 5), 2, 2) + matrix(c(2, 1, 0, 0), 2, 2),
                            matrix(c(3, 0, 3, 6), 2, 2), matrix(c(6, 2, 0, 4), 2, 2)))
mhCase("penicillin", list(matrix(c(0, 0, 6, 5), 2, 2) + 1, matrix(c(3, 0, 3, 6), 2, 2) + 2,
                          matrix(c(6, 2, 0, 4), 2, 2) + 1, matrix(c(5, 6, 1, 0), 2, 2) + 2,
                          matrix(c(2, 5, 0, 0), 2, 2) + 3))
mhCase("large_strata", lapply(1:8, function(k) matrix(rpois(4, c(40, 25, 30, 45) * k), 2, 2)))
