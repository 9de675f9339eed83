#!/usr/bin/env Rscript
# Reference values of the sign test, the Wilcoxon signed rank test and the
# runs test from R (a peer system, used as an oracle):
#  - sign test P-values: binom.test (n <= 50, or the exact form), and for the
#    large-sample form the continuity-corrected normal approximation;
#  - sign interval rows: order statistics of depth d and d+1 with d and the
#    coverages from qbinom/pbinom (or qnorm/pnorm with continuity
#    correction), interpolated after Hettmansperger and Sheather (1986);
#  - Wilcoxon: the estimate is the median of the Walsh averages (checked
#    against wilcox.test(exact = TRUE, conf.int = TRUE) where R computes it
#    that way), V from wilcox.test(exact = FALSE); the P-value from
#    wilcox.test(exact = FALSE, correct = TRUE) when there are no ties and no
#    zeros, otherwise from the same normal formula without the tie
#    correction of the variance; the interval is the pair of Walsh averages
#    of ranks k+1 and T-k with k from the normal approximation;
#  - runs test about k: counts and runs by rle() after dropping the values
#    equal to k; the exact P-value from the distribution of the number of
#    runs (Swed and Eisenhart, 1943) with choose(), the approximate one from
#    its mean and variance with pnorm;
# Writes tests/data/sign_tests_samples.csv and tests/data/sign_tests_r.csv.
# Run: Rscript tools/reference/gen_sign_tests.R (needs r-base-core).
args <- commandArgs(trailingOnly = FALSE)
here <- dirname(normalizePath(sub("--file=", "", args[grep("--file=", args)])))
data <- file.path(here, "..", "..", "tests", "data")

set.seed(8601)
samples <- list(
  one = c(3.5),
  two = c(5, 1),
  three = c(4, -1, 2),
  seven = c(6.5, 1.25, 3, 9, 2.5, 4, 8),
  ties = c(2, 2, 2, 3, 3, 7, 1, 1, 9, 2, 3, 2, 5),
  twenty = round(rnorm(20, 1, 2), 3),
  n50 = round(rnorm(50, 10, 3), 3),
  n51 = round(rnorm(51, 10, 3), 3),
  n120 = round(rexp(120, 0.5), 3)
)
mu0s <- list(one = 3, two = 5, three = 0, seven = 3, ties = 2, twenty = 0, n50 = 11, n51 = 9.5,
             n120 = 1.5)

fmt <- function(v) ifelse(is.na(v), "nan", ifelse(is.infinite(v),
                          ifelse(v > 0, "inf", "-inf"), sprintf("%.17g", v)))

signRows <- function(x, conf, type, normal) {
  s <- sort(x); n <- length(s)
  out <- rep(NA_real_, 11)  # median, cn, cw, nlo, ilo, wlo, nup, iup, wup, npos, wpos
  out[1] <- median(s)
  code <- 0
  cc <- if (type == 0) conf else 1 - 2 * (1 - conf)
  if (normal) {
    sd <- sqrt(n) / 2
    d <- floor(qnorm((1 - cc) / 2, n / 2, sd) + 0.5)
    F <- function(k) pnorm(k + 0.5, n / 2, sd)
  } else {
    d <- qbinom((1 - cc) / 2, n, 0.5)
    F <- function(k) pbinom(k, n, 0.5)
  }
  if (d == 0) {
    out[4] <- s[1]; out[7] <- s[n]; out[10] <- 1; out[2] <- 1 - 2 * F(0)
    code <- 10001
  } else {
    cw <- 1 - 2 * F(d - 1)
    out[6] <- s[d]; out[9] <- s[n - d + 1]; out[11] <- d; out[3] <- cw
    if (2 * d < n) {
      cn <- 1 - 2 * F(d)
      out[4] <- s[d + 1]; out[7] <- s[n - d]; out[10] <- d + 1; out[2] <- cn
      I <- (cw - cc) / (cw - cn)
      lam <- (n - d) * I / (d + (n - 2 * d) * I)
      out[5] <- s[d] + lam * (s[d + 1] - s[d])
      out[8] <- s[n - d + 1] + lam * (s[n - d] - s[n - d + 1])
    } else {
      I <- (cw - cc) / cw
      out[5] <- s[d] + I * (out[1] - s[d])
      out[8] <- s[n - d + 1] + I * (out[1] - s[n - d + 1])
      code <- 10002
    }
  }
  if (type != 0) {
    out[2:3] <- 1 - (1 - out[2:3]) / 2
    if (type == 1) out[7:9] <- Inf else out[4:6] <- -Inf
    if (type == -1 && normal) {
      wpos <- out[11]
      if (!is.na(out[10])) out[10] <- n - wpos
      if (!is.na(wpos)) out[11] <- n - wpos + 1
    }
  }
  c(out, code)
}

signP <- function(x, mu0, alt, normal) {
  below <- sum(x < mu0); above <- sum(x > mu0); tot <- below + above
  p <- if (tot == 0) 1 else if (!normal) {
    binom.test(above, tot, 0.5, c("less", "two.sided", "greater")[alt + 2])$p.value
  } else {
    half <- tot / 2
    cc <- if (alt == -1) 0.5 else if (alt == 1) -0.5 else if (above > half)
      -min(0.5, above - half) else min(0.5, half - above)
    z <- (above + cc - half) / sqrt(tot * 0.25)
    if (alt == -1) pnorm(z) else if (alt == 1) pnorm(z, lower.tail = FALSE) else
      2 * pnorm(-abs(z))
  }
  c(p, below, length(x) - below - above, above)
}

lines <- c("# kind,sample,type,confidence,alternative,mu0,median,narrowerConfidence,",
           "# widerConfidence,narrowerLower,interpolatedLower,widerLower,narrowerUpper,",
           "# interpolatedUpper,widerUpper,narrowerPosition,widerPosition,code,pValue,",
           "# below,equal,above   (kind: sign = binomial throughout, lynsign = normal above 50)")
for (name in names(samples)) {
  x <- samples[[name]]
  for (kind in c("sign", "lynsign")) {
    normal <- kind == "lynsign" && length(x) > 50
    for (type in c(0, 1, -1)) for (conf in c(0.4, 0.9, 0.95, 0.99)) {
      if (type != 0 && conf < 0.5) next  # one-sided needs 1 - 2(1 - conf) > 0
      alt <- if (type == 0) 0 else -type  # a lower bound goes with "greater"
      r <- signRows(x, conf, type, normal)
      p <- signP(x, mu0s[[name]], alt, normal)
      lines <- c(lines, paste(c(kind, name, fmt(c(type, conf, alt, mu0s[[name]], r, p))),
                              collapse = ","))
    }
  }
}
wilcoxRows <- function(x, conf, type, alt, mu0) {
  n <- length(x)
  out <- rep(NA_real_, 7)  # estimate, confidence, lower, upper, W, P, n
  if (n == 1) out[1] <- x[1]
  if (n > 1) {
    w <- outer(x, x, "+") / 2
    w <- sort(w[upper.tri(w, diag = TRUE)])
    T <- n * (n + 1) / 2
    sd <- sqrt(n * (n + 1) * (2 * n + 1) / 24)
    a <- if (type == 0) (1 - conf) / 2 else 1 - conf
    k <- qnorm(a) * sd + T / 2
    k <- if (k < 0) 0 else floor(k)
    if (k + 1 > T / 2) k <- k - 1
    p <- pnorm((k + 0.5 - T / 2) / sd)
    out[2] <- if (type == 0) 1 - 2 * p else 1 - p
    out[3] <- if (type == -1) -Inf else w[k + 1]
    out[4] <- if (type == 1) Inf else w[T - k]
    out[1] <- median(w)
    if (!any(duplicated(x)) && n < 50) {
      hl <- suppressWarnings(wilcox.test(x, exact = TRUE, conf.int = TRUE))$estimate
      stopifnot(abs(hl - out[1]) < 1e-12 * max(1, abs(hl)))
    }
  }
  d <- x - mu0
  nz <- d[d != 0]
  m <- length(nz)
  out[7] <- m
  if (m > 0) {
    alternative <- c("less", "two.sided", "greater")[alt + 2]
    V <- unname(suppressWarnings(wilcox.test(x, mu = mu0, exact = FALSE))$statistic)
    out[5] <- V
    mean <- m * (m + 1) / 4
    sd <- sqrt(m * (m + 1) * (2 * m + 1) / 24)
    cc <- if (alt == -1) 0.5 else if (alt == 1) -0.5 else if (V > mean)
      -min(0.5, V - mean) else min(0.5, mean - V)
    z <- (V + cc - mean) / sd
    out[6] <- if (alt == -1) pnorm(z) else if (alt == 1) pnorm(z, lower.tail = FALSE) else
      2 * pnorm(-abs(z))
    if (m == n && !any(duplicated(abs(nz))) && abs(V - mean) >= 0.5) {
      pr <- wilcox.test(x, mu = mu0, exact = FALSE, correct = TRUE,
                        alternative = alternative)$p.value
      stopifnot(abs(pr - out[6]) < 1e-13)
    }
  }
  out
}
lines <- c(lines, "# wilcoxon,sample,type,confidence,alternative,mu0,estimate,confidence,lower,upper,W,P,n")
for (name in names(samples)) {
  x <- samples[[name]]
  for (type in c(0, 1, -1)) for (conf in c(0.9, 0.95)) {
    alt <- if (type == 0) 0 else -type
    r <- wilcoxRows(x, conf, type, alt, mu0s[[name]])
    lines <- c(lines, paste(c("wilcoxon", name, fmt(c(type, conf, alt, mu0s[[name]], r))),
                            collapse = ","))
  }
}
runsProb <- function(r, n1, n2) {
  ch <- function(a, b) if (b < 0 || a < 0 || b > a) 0 else choose(a, b)
  if (r %% 2 == 0) {
    h <- r / 2 - 1
    2 * ch(n1 - 1, h) * ch(n2 - 1, h) / choose(n1 + n2, n1)
  } else {
    h <- (r - 1) / 2
    (ch(n1 - 1, h) * ch(n2 - 1, h - 1) + ch(n1 - 1, h - 1) * ch(n2 - 1, h)) / choose(n1 + n2, n1)
  }
}
lines <- c(lines, "# runs,sample,k,below,above,runs,expected,exactP,approximateP")
for (name in names(samples)) {
  x <- samples[[name]]
  for (k in c(mu0s[[name]], median(x))) {
    y <- x[x != k]
    above <- sum(y > k); below <- length(y) - above; m <- length(y)
    runs <- length(rle(y > k)$lengths)
    expected <- if (m > 0) 2 * above * below / m + 1 else NA
    exact <- NA; approx <- NA
    if (above > 0 && below > 0) {
      lo <- sum(vapply(2:runs, function(r) runsProb(r, below, above), 0))
      up <- sum(vapply(runs:m, function(r) runsProb(r, below, above), 0))
      exact <- min(1, 2 * min(lo, up))
      A <- 2 * above * below
      v <- A * (A - m) / (m * m * (m - 1))
      if (v > 0) approx <- 2 * pnorm(-abs(runs - expected) / sqrt(v))
    }
    lines <- c(lines, paste(c("runs", name, fmt(c(k, below, above, runs, expected, exact, approx))),
                            collapse = ","))
  }
}
writeLines(lines, file.path(data, "sign_tests_r.csv"))
writeLines(vapply(names(samples), function(k) paste(c(k, fmt(samples[[k]])), collapse = ","), ""),
           file.path(data, "sign_tests_samples.csv"))
