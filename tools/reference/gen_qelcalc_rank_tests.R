#!/usr/bin/env Rscript
# Expected values of the `qelcalc test` checks of the distribution-free tests
# (tests/check_qelcalc.cmake), computed by R, a peer used as an oracle:
#  - mann-whitney: W and the tie-adjusted P-value from wilcox.test(exact =
#    FALSE, correct = TRUE); the P-value without the tie adjustment from the
#    same normal formula with the plain variance; the Hodges-Lehmann shift and
#    the limits as order statistics of all x - y, the rank k from the normal
#    approximation (Lehmann 1975);
#  - kruskal-wallis: the tie-adjusted H and P-value from kruskal.test; H
#    without the adjustment, mean ranks and z from rank() of the pooled data;
#  - mood: the 2 x k table of counts at or below / above the overall median
#    and chisq.test(correct = FALSE);
#  - friedman: friedman.test on the blocks x treatments matrix, rank sums
#    from rank() within rows;
#  - sign: binom.test and the order statistics of depth d, d + 1 with d from
#    qbinom, interpolated after Hettmansperger and Sheather (1986);
#  - wilcoxon (paired differences): V and P from wilcox.test(exact = FALSE,
#    correct = TRUE) (no ties, no zeros), the estimate and limits from the
#    sorted Walsh averages;
#  - runs: counts by rle() and the exact P-value from the distribution of the
#    number of runs (Swed and Eisenhart 1943) with choose().
# Run: Rscript tools/reference/gen_qelcalc_rank_tests.R; it prints
# "test name value" lines, copied into the checks.
options(digits = 17)
out <- function(test, name, v) cat(test, name, sprintf("%.17g", v), "\n")

# The table of the checks (columns a, b, c; c is shorter).
a <- c(1.83, 0.50, 1.62, 2.48, 1.68, 1.88, 1.55, 3.06, 1.30)
b <- c(0.878, 0.647, 0.598, 2.05, 1.06, 1.29, 1.06, 3.14, 1.29)
cc <- c(2.1, 3.3, 2.9, 4.0, 1.9, 3.6)

# Mann-Whitney a vs b, 95% two-sided.
n1 <- length(a); n2 <- length(b); N <- n1 * n2
r <- wilcox.test(a, b, exact = FALSE, correct = TRUE)
W <- unname(r$statistic) + n1 * (n1 + 1) / 2
EW <- n1 * (n1 + n2 + 1) / 2
sdPlain <- sqrt((n1 + n2 + 1) * n1 * n2 / 12)
z <- (W - EW - sign(W - EW) * min(0.5, abs(W - EW))) / sdPlain
d <- sort(as.vector(outer(b, a, "-")))
k <- max(0, floor(N / 2 - 0.5 + qnorm(0.025) * sqrt((n1 + n2 + 1) * N / 12)))
out("mw", "W", W)
out("mw", "p", 2 * pnorm(-abs(z)))
out("mw", "adjusted_p", r$p.value)
out("mw", "estimate", median(-d))
out("mw", "lower", -d[N - k])
out("mw", "upper", -d[k + 1])
out("mw", "achieved_confidence", 1 - 2 * pnorm((k + 0.5 - N / 2) / sdPlain))

# Kruskal-Wallis on a, b, c.
groups <- list(a, b, cc)
r <- kruskal.test(groups)
all <- unlist(groups); N <- length(all)
ranks <- rank(all)
id <- rep(seq_along(groups), sapply(groups, length))
meanRank <- tapply(ranks, id, mean)
n <- sapply(groups, length)
H <- 12 / (N * (N + 1)) * sum(n * meanRank^2) - 3 * (N + 1)
out("kw", "H", H)
out("kw", "p", pchisq(H, length(groups) - 1, lower.tail = FALSE))
out("kw", "adjusted_H", unname(r$statistic))
out("kw", "adjusted_p", r$p.value)
for (g in seq_along(groups)) {
  out("kw", paste0("group", g, "_median"), median(groups[[g]]))
  out("kw", paste0("group", g, "_mean_rank"), meanRank[g])
  out("kw", paste0("group", g, "_z"), (meanRank[g] - (N + 1) / 2) /
        sqrt((N + 1) / 12 * (N - n[g]) / n[g]))
}

# Mood's median test on a, b, c.
M <- median(all)
tab <- rbind(sapply(groups, function(g) sum(g <= M)), sapply(groups, function(g) sum(g > M)))
r <- suppressWarnings(chisq.test(tab, correct = FALSE))
out("mood", "overall_median", M)
out("mood", "chi_square", unname(r$statistic))
out("mood", "p", r$p.value)
for (g in seq_along(groups)) {
  out("mood", paste0("group", g, "_count_at_or_below"), tab[1, g])
  out("mood", paste0("group", g, "_count_above"), tab[2, g])
}

# Friedman on the first six rows (blocks) of a, b, c.
m <- cbind(a[1:6], b[1:6], cc)
r <- friedman.test(m)
out("friedman", "S", unname(r$statistic))
out("friedman", "p", r$p.value)
rs <- colSums(t(apply(m, 1, rank)))
for (t in seq_along(rs)) out("friedman", paste0("treatment", t, "_rank_sum"), rs[t])

# Sign test of a about 1, 95% two-sided.
s <- sort(a); n <- length(s)
out("sign", "p", binom.test(sum(a > 1), sum(a != 1))$p.value)
dd <- qbinom(0.025, n, 0.5)
cw <- 1 - 2 * pbinom(dd - 1, n, 0.5)
cn <- 1 - 2 * pbinom(dd, n, 0.5)
I <- (cw - 0.95) / (cw - cn)
lambda <- (n - dd) * I / (dd + (n - 2 * dd) * I)
out("sign", "narrower_confidence", cn)
out("sign", "wider_confidence", cw)
out("sign", "narrower_lower", s[dd + 1])
out("sign", "interpolated_lower", s[dd] + lambda * (s[dd + 1] - s[dd]))
out("sign", "wider_lower", s[dd])
out("sign", "narrower_upper", s[n - dd])
out("sign", "interpolated_upper", s[n - dd + 1] + lambda * (s[n - dd] - s[n - dd + 1]))
out("sign", "wider_upper", s[n - dd + 1])

# Wilcoxon signed rank test of the paired differences a - b, 95% two-sided.
x <- a - b; n <- length(x)
r <- wilcox.test(x, exact = FALSE, correct = TRUE)
w <- outer(x, x, "+") / 2
w <- sort(w[upper.tri(w, diag = TRUE)])
T <- n * (n + 1) / 2
sd <- sqrt(n * (n + 1) * (2 * n + 1) / 24)
k <- floor(qnorm(0.025) * sd + T / 2)
out("wilcoxon", "W", unname(r$statistic))
out("wilcoxon", "p", r$p.value)
out("wilcoxon", "estimate", median(w))
out("wilcoxon", "lower", w[k + 1])
out("wilcoxon", "upper", w[T - k])
out("wilcoxon", "achieved_confidence", 1 - 2 * pnorm((k + 0.5 - T / 2) / sd))

# Runs of a about 1.7.
y <- a[a != 1.7]
above <- sum(y > 1.7); below <- length(y) - above
runs <- length(rle(y > 1.7)$lengths)
runsProb <- function(r, n1, n2) {
  ch <- function(p, q) if (q < 0 || p < 0 || q > p) 0 else choose(p, q)
  if (r %% 2 == 0) {
    h <- r / 2 - 1
    2 * ch(n1 - 1, h) * ch(n2 - 1, h) / choose(n1 + n2, n1)
  } else {
    h <- (r - 1) / 2
    (ch(n1 - 1, h) * ch(n2 - 1, h - 1) + ch(n1 - 1, h - 1) * ch(n2 - 1, h)) / choose(n1 + n2, n1)
  }
}
lower <- sum(sapply(2:runs, runsProb, below, above))
upper <- sum(sapply(runs:length(y), runsProb, below, above))
out("runs", "count_below", below)
out("runs", "count_above", above)
out("runs", "observed_runs", runs)
out("runs", "expected_runs", 2 * above * below / length(y) + 1)
out("runs", "p", min(1, 2 * min(lower, upper)))
