#!/usr/bin/env Rscript
# Reference values of qel.power (tests/python/test_power.py) from R, a peer
# used as an oracle: power.t.test and power.prop.test with strict = TRUE
# (both tails in the two-sided power), the z power from pnorm.
# Rows: [function, keyword arguments, row index, field, expected, rtol].
# Run: Rscript tools/reference/gen_python_power_r.R > tests/data/python_power_r.json
rows <- list()
add <- function(fn, kwargs, index, field, expected, rtol) {
  rows[[length(rows) + 1]] <<- sprintf('["%s", %s, %d, "%s", %.17g, %g]', fn, kwargs, index,
                                       field, expected, rtol)
}
tt <- function(...) power.t.test(..., strict = TRUE, tol = 1e-13)
add("t_test", '{"n": 20, "effect": 1.0, "two_sample": true}', 0, "power",
    tt(n = 20, delta = 1)$power, 1e-9)
add("t_test", '{"n": 15, "effect": 0.6, "sigma": 1.5}', 0, "power",
    tt(n = 15, delta = 0.6, sd = 1.5, type = "one.sample")$power, 1e-9)
add("t_test", '{"n": 12, "effect": 0.8, "alternative": "greater"}', 0, "power",
    tt(n = 12, delta = 0.8, type = "one.sample", alternative = "one.sided")$power, 1e-9)
add("t_test", '{"effect": 0.5, "power": [0.8, 0.9], "two_sample": true}', 1, "n",
    ceiling(tt(delta = 0.5, power = 0.9)$n), 0)
add("t_test", '{"n": 25, "power": 0.9, "sigma": 2.0}', 0, "effect",
    tt(n = 25, power = 0.9, sd = 2, type = "one.sample")$delta, 1e-7)
add("paired_t", '{"n": 10, "power": 0.8, "alternative": "less"}', 0, "effect",
    -tt(n = 10, power = 0.8, type = "paired", alternative = "one.sided")$delta, 1e-7)
z <- qnorm(0.975)
add("z_test", '{"n": [10, 20], "effect": 0.5}', 1, "power",
    pnorm(0.5 * sqrt(20) - z) + pnorm(-0.5 * sqrt(20) - z), 1e-12)
pp <- function(...) power.prop.test(..., strict = TRUE, tol = 1e-13)
add("proportion", '{"n": 50, "effect": 0.2, "null": 0.3, "two_sample": true}', 0, "power",
    pp(n = 50, p1 = 0.3, p2 = 0.5)$power, 1e-9)
add("proportion", '{"n": 50, "power": 0.8, "null": 0.4, "two_sample": true}', 0, "effect",
    pp(n = 50, p1 = 0.4, power = 0.8)$p2, 1e-7)
add("proportion", '{"effect": -0.15, "power": 0.9, "null": 0.6, "two_sample": true}', 0, "n",
    ceiling(pp(p1 = 0.6, p2 = 0.45, power = 0.9)$n), 0)
cat("[\n  ", paste(rows, collapse = ",\n  "), "\n]\n", sep = "")
