# TOST power by R's noncentral t: pt(-t, df, ncp = b) - pt(t, df, ncp = a),
# clamped at 0, for the cases of tests/data/tost_power.csv (read from it so
# that both references cover the same inputs). Writes tests/data/tost_power_r.csv
# with columns type, n, d, sigma, level, lower, upper, power.
# Run from the repository root: Rscript tools/reference/gen_tost_power_r.R
cases <- read.csv("tests/data/tost_power.csv", header = FALSE, comment.char = "#")
out <- file("tests/data/tost_power_r.csv", "w")
writeLines("# type,n,d,sigma,level,lower,upper,power (gen_tost_power_r.R, R pt)", out)
for (i in seq_len(nrow(cases))) {
  r <- as.numeric(cases[i, 1:7])
  tt <- r[1]; n <- r[2]; d <- r[3]; sigma <- r[4]; level <- r[5]
  lower <- r[6]; upper <- r[7]
  df <- if (tt == 2) 2 * n - 2 else n - 1
  se <- sigma * sqrt((if (tt == 2) 2 else 1) / n)
  t <- qt(1 - level, df)
  p <- pt(-t, df, ncp = (d - upper) / se) - pt(t, df, ncp = (d - lower) / se)
  writeLines(paste(sprintf("%.17g", c(r, max(p, 0))), collapse = ","), out)
}
close(out)
