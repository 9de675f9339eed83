#!/usr/bin/env Rscript
# Reference values of the chi-square goodness-of-fit test on a table of
# counts from R's chisq.test(x, p = p) (a peer system, used as an oracle):
# expected counts, squared Pearson residuals (the contributions), the
# statistic and the upper-tail P-value. Cases: k = 2 to 1000, equal, unequal
# and tiny proportions, counts up to 1e9.
# Writes tests/data/tabular_gof_r.csv, rows
#   case,k,equal,statistic,pValue       (one per case, kind "case")
#   cell,case,observed,p,expected,contribution   (kind "cell")
# Run: Rscript tools/reference/gen_tabular_gof.R (needs r-base-core).
args <- commandArgs(trailingOnly = FALSE)
here <- dirname(normalizePath(sub("--file=", "", args[grep("--file=", args)])))
out <- file.path(here, "..", "..", "tests", "data", "tabular_gof_r.csv")

set.seed(2929)
cases <- list()
add <- function(x, p, equal) cases[[length(cases) + 1]] <<- list(x = x, p = p, equal = equal)
add(c(30, 70), c(0.5, 0.5), TRUE)
add(c(18, 22, 25, 35), c(0.1, 0.2, 0.3, 0.4), FALSE)
add(c(12, 0, 3, 40, 9), rep(0.2, 5), TRUE)
# Tiny proportions: a rare category with a few counts.
add(c(999990, 7, 3), c(1 - 2e-6, 1e-6, 1e-6), FALSE)
add(c(5e8, 4.99999e8, 1e9 - 5e8 - 4.99999e8 + 123), c(0.4999, 0.4999, 0.0002), FALSE)
# Counts to 1e9 with unequal proportions.
w <- runif(50) + 0.01
p50 <- w / sum(w)
add(round(p50 * 1e9 * (1 + rnorm(50, sd = 1e-4))), p50, FALSE)
add(rpois(200, 40), rep(1 / 200, 200), TRUE)
w <- rexp(1000)
p1000 <- w / sum(w)
add(rpois(1000, p1000 * 1e6), p1000, FALSE)
add(rpois(1000, 5), rep(1 / 1000, 1000), TRUE)

con <- file(out, "w")
writeLines(c("# From tools/reference/gen_tabular_gof.R: R chisq.test(x, p = p).",
             "# case,id,k,equal,statistic,pValue",
             "# cell,id,observed,p,expected,contribution"), con)
for (id in seq_along(cases)) {
  cs <- cases[[id]]
  r <- suppressWarnings(chisq.test(cs$x, p = cs$p))
  writeLines(sprintf("case,%d,%d,%d,%.17g,%.17g", id, length(cs$x), as.integer(cs$equal),
                     r$statistic, r$p.value), con)
  writeLines(sprintf("cell,%d,%.17g,%.17g,%.17g,%.17g", id, cs$x, cs$p, r$expected,
                     r$residuals^2), con)
}
close(con)
