# Reference powers of two-level factorial and one-way designs from R.
# Run from the repository root: Rscript tools/reference/gen_factorial_power_r.R
#
# tests/data/factorial_power_r.csv: factors, runs, blocks, blocks_in_model,
# cp_per_block, cp_in_model, terms_omitted_df, r, effect, sigma, level, df,
# power. The error df are worked out by hand for each design (comment per
# case); the power is 1 - pf(qf(1 - level, 1, df), 1, df, ncp = N (effect /
# (2 sigma))^2) with N = r x runs corner runs.
#
# tests/data/oneway_power_r.csv: groups, r, ss_means, sigma, level, power,
# n_for_0.8: power.anova.test with between.var = ss / (groups - 1) (var()
# divides by groups - 1) and within.var = sigma^2, and the ceiling of the
# n it solves for power 0.8.
f <- function(factors, runs, blocks, bim, cp, cpim, omitted, r, effect, sigma, level, df) {
  ncp <- r * runs * (effect / (2 * sigma))^2
  p <- 1 - pf(qf(1 - level, 1, df), 1, df, ncp = ncp)
  c(factors, runs, blocks, bim, cp, cpim, omitted, r, effect, sigma, level, df, p)
}
rows <- list(
  # 2^3 full, r = 2: 16 runs - 8 corner df = 8
  f(3, 8, 1, 0, 0, 0, 0, 2, 1.5, 1, 0.05, 8),
  # 2^3, r = 1, 4 center points, not in model: 8 - 8 + 4 = 4
  f(3, 8, 1, 0, 4, 0, 0, 1, 3, 1, 0.05, 4),
  # same, center points in the model: 3
  f(3, 8, 1, 0, 4, 1, 0, 1, 3, 1, 0.05, 3),
  # 2^4, r = 3, 2 blocks in model: 48 - 16 - (2 - 2) = 32 (3 x 2 is even)
  f(4, 16, 2, 1, 0, 0, 0, 3, 1, 1.2, 0.1, 32),
  # 2^4, r = 4, 2 blocks in model: t = 1, 1 free block df: 64 - 16 - 1 = 47
  f(4, 16, 2, 1, 0, 0, 0, 4, 0.8, 1, 0.05, 47),
  # 2^3 with the three-way term omitted (omitted df 1), r = 1: 1
  f(3, 8, 1, 0, 0, 0, 1, 1, 4, 1, 0.05, 1),
  # 2^5 half fraction (16 runs), r = 2, 2 center points in each of 4 blocks
  # (not in model, blocks not in model): 32 - 16 + 8 = 24
  f(5, 16, 4, 0, 2, 0, 0, 2, 1, 1, 0.05, 24)
)
out <- file("tests/data/factorial_power_r.csv", "w")
writeLines("# factors,runs,blocks,bim,cp,cpim,omitted,r,effect,sigma,level,df,power (R pf)", out)
for (x in rows) writeLines(paste(sprintf("%.17g", x), collapse = ","), out)
close(out)

g <- function(groups, r, ss, sigma, level) {
  p <- power.anova.test(groups = groups, n = r, between.var = ss / (groups - 1),
                        within.var = sigma^2, sig.level = level)$power
  n <- power.anova.test(groups = groups, between.var = ss / (groups - 1),
                        within.var = sigma^2, sig.level = level, power = 0.8)$n
  c(groups, r, ss, sigma, level, p, ceiling(n))
}
rows <- list(g(3, 5, 0.5, 1, 0.05), g(4, 10, 0.3, 1, 0.05), g(2, 8, 2, 1.5, 0.1),
             g(5, 20, 0.125, 1, 0.01), g(6, 3, 4, 1, 0.05))
out <- file("tests/data/oneway_power_r.csv", "w")
writeLines("# groups,r,ss_means,sigma,level,power,n_for_0.8 (R power.anova.test)", out)
for (x in rows) writeLines(paste(sprintf("%.17g", x), collapse = ","), out)
close(out)
