# Reference polynomial fits from R's lm(y ~ poly(x, d, raw = TRUE)) and
# lm(y ~ 0 + poly(x, d, raw = TRUE)), with R^2 and sigma from summary.lm.
# Run: Rscript tools/reference/gen_curve_fit_r.R > tests/data/curve_fit_r.csv
#
# The data are rebuilt by the test from the parameters of each row, with
# integer arithmetic that is exact in doubles:
#   s_0 = seed, s_{i+1} = (69069 s_i + 1) mod 2^32, u_i = s_i / 2^32;
#   x_i = (floor(256 u_{2i+1}) - 128) / 64            (8-bit dyadic in [-2, 2))
#   y_i = sum_j b_j x_i^j + noise (floor(2^20 u_{2i+2}) / 2^20 - 1/2)
# with b = 1.5, -0.75, 0.25, 0.5, -0.125, 0.0625 (the first d + 1), every
# term exact. Rows: n,degree,intercept(0/1),seed,noise, then d + 1
# coefficients (the intercept, 0 without it; NA as nan), R^2, sigma.
options(digits = 17)
b <- c(1.5, -0.75, 0.25, 0.5, -0.125, 0.0625)
lcg <- function(seed, count) {
  s <- numeric(count); state <- seed
  for (i in seq_len(count)) { state <- (69069 * state + 1) %% 4294967296; s[i] <- state }
  s / 4294967296
}
makeData <- function(n, d, seed, noise) {
  u <- lcg(seed, 2 * n)
  x <- (floor(256 * u[seq(1, 2 * n, 2)]) - 128) / 64
  y <- rep(0, n)
  for (j in 0:d) y <- y + b[j + 1] * x^j
  y <- y + noise * (floor(2^20 * u[seq(2, 2 * n, 2)]) / 2^20 - 0.5)
  list(x = x, y = y)
}
fmt <- function(v) ifelse(is.na(v), "nan", sprintf("%.17g", v))
emit <- function(n, d, intercept, seed, noise) {
  data <- makeData(n, d, seed, noise)
  x <- data$x; y <- data$y
  fit <- if (d == 0) lm(y ~ 1)
         else if (intercept) lm(y ~ poly(x, d, raw = TRUE))
         else lm(y ~ 0 + poly(x, d, raw = TRUE))
  coefs <- unname(coef(fit))
  if (!intercept) coefs <- c(0, coefs)
  s <- suppressWarnings(summary(fit))
  r2 <- if (d == 0) 0 else s$r.squared
  sigma <- if (df.residual(fit) > 0) s$sigma else NA
  cat(paste(c(n, d, as.numeric(intercept), seed, noise, fmt(c(coefs, r2, sigma))), collapse = ","),
      "\n", sep = "")
}
seed <- 11
for (d in 0:5) {
  for (intercept in c(TRUE, FALSE)) {
    if (d == 0 && !intercept) next
    for (n in c(d + 1, d + 3, 40, 10000)) {
      emit(n, d, intercept, seed, 0.5)
      seed <- seed + 2
    }
  }
  emit(200, d, TRUE, seed, 0)  # exact data: R^2 = 1
  seed <- seed + 2
}
