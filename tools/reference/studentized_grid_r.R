# R's ptukey on the rows of tests/data/studentized_range_grid_mp.csv (mpmath
# truth from tools/reference/gen_studentized_grid.py), for the accuracy report.
# ptukey refuses df < 2: those rows get NA.
# Writes tests/data/studentized_range_grid_r.csv: k, df, q, mpmath upper,
# ptukey upper, relative error of ptukey; prints the worst rows.
# Run from the repository root: Rscript tools/reference/studentized_grid_r.R
grid <- read.csv("tests/data/studentized_range_grid_mp.csv", comment.char = "#", header = FALSE,
                 col.names = c("k", "df", "q", "upper", "err"), colClasses = "character")
k <- as.integer(grid$k)
df <- as.numeric(grid$df)
q <- as.numeric(grid$q)
truth <- as.numeric(grid$upper)
r <- ifelse(df >= 2, suppressWarnings(ptukey(q, k, pmax(df, 2), lower.tail = FALSE)), NA)
rel <- abs(r - truth) / truth
out <- sprintf("%d,%s,%s,%s,%.17g,%.3g", k, grid$df, grid$q, grid$upper, r, rel)
writeLines(c("# From tools/reference/studentized_grid_r.R (R ptukey against mpmath).",
             "# k,df,q,upper,ptukey,relative error", out),
           "tests/data/studentized_range_grid_r.csv")
ok <- !is.na(rel)
cat(sprintf("%d rows, %d with df >= 2; worst relative %.3g, worst absolute %.3g\n", length(rel),
            sum(ok), max(rel[ok]), max(abs(r - truth)[ok])))
for (lim in c(1e-3, 1e-6, 1e-9)) cat(sprintf("rows above %g relative: %d\n", lim, sum(rel[ok] > lim)))
worst <- order(-ifelse(ok, rel, -1))[1:8]
print(data.frame(k = k, df = df, q = q, truth = truth, ptukey = r, rel = rel)[worst, ])
for (d in unique(df[ok])) cat(sprintf("df %s: worst %.3g\n", d, max(rel[ok & df == d])))
