#!/usr/bin/env Rscript
# Expected values of the `qelcalc power` checks (tests/check_qelcalc.cmake),
# computed by R, a peer used as an oracle: power.t.test and power.prop.test
# with strict = TRUE, the z power from pnorm, and the smallest whole n of the
# chi-square variance test and of the Poisson normal approximation by a walk
# over n with pchisq/qchisq and pnorm.
# Run: Rscript tools/reference/gen_qelcalc_power.R
options(digits = 12)
cat("t two-sample n (delta 0.5, power 0.8):",
    ceiling(power.t.test(delta = 0.5, power = 0.8, strict = TRUE)$n), "\n")
qz <- qnorm(0.975)
zp <- function(n) pnorm(0.5 * sqrt(n) - qz) + pnorm(-0.5 * sqrt(n) - qz)
cat("z power n = 10, 20 (effect 0.5):", zp(10), zp(20), "\n")
cat("paired effect (n 10, power 0.8, less):",
    -power.t.test(n = 10, power = 0.8, type = "paired", alternative = "one.sided",
                  strict = TRUE, tol = 1e-12)$delta, "\n")
cat("prop roots (null 0.4, n 50 per group, power 0.8):",
    power.prop.test(n = 50, p1 = 0.4, power = 0.8, strict = TRUE, tol = 1e-12)$p2,
    1 - power.prop.test(n = 50, p1 = 0.6, power = 0.8, strict = TRUE, tol = 1e-12)$p2, "\n")
vp <- function(n, r) pchisq(qchisq(0.05, n - 1, lower.tail = FALSE) / r, n - 1, lower.tail = FALSE)
n <- 2; while (vp(n, 2) < 0.9) n <- n + 1
cat("variance chisq one-sample n (ratio 2, power 0.9, greater):", n, "\n")
pp <- function(n, rate, e) {
  z <- qnorm(0.95); s0 <- sqrt(rate / n); s1 <- sqrt((rate + e) / n)
  pnorm((z * s0 - e) / s1, lower.tail = FALSE)
}
n <- 1; while (pp(n, 2, 0.5) < 0.9) n <- n + 1
cat("poisson one-sample n (rate 2, effect 0.5, power 0.9, greater):", n, "\n")
