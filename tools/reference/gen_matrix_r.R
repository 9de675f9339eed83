# A second oracle for the value matrices: R's LAPACK (solve, determinant,
# chol, eigen) on two matrices built from integer formulas, so that the test
# rebuilds them exactly without a data file of n^2 numbers.
# Run: Rscript tools/reference/gen_matrix_r.R > tests/data/matrix_r_lapack.csv
#
#   general G (i, j from 0): ((3i + 7j + ij) mod 29 - 14) / 14, plus 2 on the diagonal
#   symmetric S: ((i + 1)(j + 1) mod 23 - 11) / 11, plus n + i on the diagonal
#   b: (i mod 5) - 2
# Rows: kind,n,numbers...
#   solve : 1/rcond(G) in the infinity norm, then x with G x = b
#   det   : log |det G|, sign of det G
#   chol  : 1/rcond(S), then the diagonal of R with R'R = S
#   eigen : the infinity norm of S, then the eigenvalues ascending, then the
#           magnitudes of the last row of the eigenvector matrix
emitRow <- function(kind, n, v) cat(paste(c(kind, n, sprintf("%.17g", v)), collapse = ","), "\n", sep = "")
cat("# kind,n,numbers (see tools/reference/gen_matrix_r.R), from", R.version.string, "\n")
for (n in c(100, 500)) {
  i <- matrix(0:(n - 1), n, n)
  j <- t(i)
  G <- ((3 * i + 7 * j + i * j) %% 29 - 14) / 14 + diag(2, n)
  S <- (((i + 1) * (j + 1)) %% 23 - 11) / 11 + diag(n + 0:(n - 1))
  b <- (0:(n - 1)) %% 5 - 2
  emitRow("solve", n, c(1 / rcond(G, norm = "I"), solve(G, b)))
  d <- determinant(G, logarithm = TRUE)
  emitRow("det", n, c(as.numeric(d$modulus), d$sign))
  emitRow("chol", n, c(1 / rcond(S, norm = "I"), diag(chol(S))))
  e <- eigen(S, symmetric = TRUE)
  ord <- order(e$values)
  emitRow("eigen", n, c(max(rowSums(abs(S))), e$values[ord], abs(e$vectors[n, ord])))
}
