// Tests of independence and of symmetry: Pearson's chi-square, the
// likelihood ratio G, Cramer's V squared, Fisher's exact test and McNemar's
// test on a 2 x 2 table, and the Mantel-Haenszel-Cochran test over strata of
// 2 x 2 tables.
#include <qel/basic_types.h>
#include <qel/distributions.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <stdexcept>

#include "basic_statistics/ContingencyTable.h"
#include "interfaces/basic_statistics/utilities.h"
#include "interfaces/math/random_distributions_v1.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {

namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
// The P-value slot of a test that needs a 2 x 2 table, for a table of another
// shape.
constexpr double kNotTwoByTwo = -2.0;

// Sum of (o - e)^2 / e over the cells of non-empty columns with a positive
// expected count, compensated (Kahan).
double pearsonSum(TableColumns o, TableColumns e, double const* T, unsigned C, unsigned R) {
  v1::CompensatedSum sum;
  for (unsigned c = 0; c < C; ++c) {
    if (!(T[c] > 0.0)) continue;
    for (unsigned r = 0; r < R; ++r) {
      const double expected = e[c][r];
      if (!(expected > 0.0)) continue;
      const double d = o[c][r] - expected;
      sum.add(d * (d / expected));
    }
  }
  return sum.sum;
}

double degreesOfFreedom(unsigned Cp, unsigned Rp) {
  return (static_cast<double>(Rp) - 1.0) * (static_cast<double>(Cp) - 1.0);
}

// A count truncated to an unsigned integer, or false when it is not a count
// that an unsigned can hold (negative, NaN, too large).
bool truncatedCount(double x, unsigned* n) {
  if (!(x >= 0.0 && x <= static_cast<double>(std::numeric_limits<unsigned>::max()))) return false;
  *n = static_cast<unsigned>(x);
  return true;
}

}  // namespace

// The upper tail is computed here, in the section; ChiSqCdf arms and resets
// the floating-point state of the thread that runs it. An overflow trap that
// its kernel does not catch leaves NaN, not an armed thread.
void GetPearsonChisquareTest(TableColumns o, TableColumns e, double* out, double const* T,
                             unsigned C, unsigned R, unsigned Cp, unsigned Rp, unsigned mask) {
  if (!isRequested(mask, kTablePearsonChisquare, out)) return;
  if (Cp == 0 || Rp == 0) {
    out[0] = out[1] = out[2] = kNaN;
    return;
  }
  out[0] = pearsonSum(o, e, T, C, R);
  out[1] = degreesOfFreedom(Cp, Rp);
  try {
    out[2] = ChiSqCdf(out[0], out[1], 0.0, true);
  } catch (std::runtime_error const&) {
    ResetFpuStates();
    out[2] = kNaN;
  }
}

void GetLikelihoodRatioTest(TableColumns o, TableColumns e, double* out, double const* T,
                            unsigned C, unsigned R, unsigned Cp, unsigned Rp, unsigned mask) {
  if (!isRequested(mask, kTableLikelihoodRatio, out)) return;
  if (Cp == 0 || Rp == 0) {
    out[0] = out[1] = out[2] = kNaN;
    return;
  }
  v1::CompensatedSum sum;
  for (unsigned c = 0; c < C; ++c) {
    if (!(T[c] > 0.0)) continue;
    for (unsigned r = 0; r < R; ++r) {
      const double observed = o[c][r], expected = e[c][r];
      if (expected > 0.0 && observed > 0.0) sum.add(observed * std::log(observed / expected));
    }
  }
  out[0] = 2.0 * sum.sum;
  out[1] = degreesOfFreedom(Cp, Rp);
  out[2] = -1.0;  // the P-value comes later, on the calling thread
}

void GetCramerVSquared(TableColumns o, TableColumns e, double const* T, double* out, double N,
                       unsigned C, unsigned R, unsigned Cp, unsigned Rp, unsigned mask) {
  if (!isRequested(mask, kTableCramerVSquare, out)) return;
  if (Cp == 0 || Rp == 0) {
    *out = kNaN;
    return;
  }
  const double smaller = static_cast<double>(std::min(Cp, Rp));
  *out = pearsonSum(o, e, T, C, R) / (N * (smaller - 1.0));
}

// Two-sided, on the hypergeometric law of cell (0, 0) given the margins
// (row 0 total marked, column 0 total drawn).
void GetFisherExactTest(TableColumns o, double const* T, double const* U, double* out, double N,
                        unsigned C, unsigned R, unsigned Cp, unsigned Rp, unsigned mask) {
  if (!isRequested(mask, kTableFisherExact, out)) return;
  if (C != 2 || R != 2) {
    *out = kNotTwoByTwo;
    return;
  }
  const bool counts = o[0][0] >= 0.0 && o[0][1] >= 0.0 && o[1][0] >= 0.0 && o[1][1] >= 0.0;
  unsigned x, total, marked, drawn;
  if (Cp != 2 || Rp != 2 || !counts || !truncatedCount(o[0][0], &x) || !truncatedCount(N, &total) ||
      !truncatedCount(U[0], &marked) || !truncatedCount(T[0], &drawn)) {
    *out = kNaN;
    return;
  }
  *out = v1::HypergeometricPValue(x, total, marked, drawn, kAlternativeNotEqual);
}

// McNemar's test of symmetry on the discordant cells b = (1, 0) and
// c = (0, 1): the difference of the marginal proportions with a 95% Wald
// interval widened by the continuity term 1/N, and the exact binomial
// P-value of the smaller discordant count among b + c.
void GetMcNemarTest(TableColumns o, double const* /*T*/, double const* /*U*/, double* out, double N,
                    unsigned C, unsigned R, unsigned /*Cp*/, unsigned /*Rp*/, unsigned mask) {
  if (!isRequested(mask, kTableMcNemar, out)) return;
  if (C != 2 || R != 2) {
    out[0] = out[1] = out[2] = kNaN;
    out[3] = kNotTwoByTwo;
    return;
  }
  if (N == 0.0 || !std::isfinite(N)) {
    out[0] = out[1] = out[2] = out[3] = kNaN;
    return;
  }
  const double b = o[1][0], c = o[0][1];
  const double estimate = (b - c) / N;
  const double z = v1::NormalInvCdf(0.975, 0.0, 1.0);
  const double halfWidth = (z * std::sqrt(b + c - (b - c) * estimate) + 1.0) / N;
  out[0] = estimate;
  out[1] = estimate - halfWidth;
  out[2] = estimate + halfWidth;
  unsigned discordant;
  const double smaller = std::min(b, c);
  if (smaller >= 0.0 && truncatedCount(b + c, &discordant)) {
    out[3] = std::min(1.0, 2.0 * v1::BinomialCdf(smaller, discordant, 0.5, false));
  } else {
    out[3] = kNaN;
  }
}

// One stratum of the Mantel-Haenszel-Cochran test: a - E(a), the
// hypergeometric variance of a, and the two halves ad/N and bc/N of the
// Mantel-Haenszel common odds ratio.
void GetMHCTest(TableColumns o, double const* T, double const* U, double* out, bool* firstStratum,
                bool* invalidStratum, double N, unsigned C, unsigned R, unsigned Cp, unsigned Rp,
                unsigned mask) {
  if ((mask & kTableMHCTest) == 0) return;
  if (C != 2 || R != 2) {
    // Only a first stratum of the wrong shape spoils the run; a later one
    // is skipped.
    if (*firstStratum) {
      if (out != nullptr) out[0] = out[1] = out[2] = out[3] = kNaN;
      *invalidStratum = true;
    }
  } else if (Cp == 2 && Rp == 2 && out != nullptr) {
    const double a = o[0][0], b = o[0][1], c = o[1][0], d = o[1][1];
    const double expected = U[0] * T[0] / N;
    out[0] += a - expected;
    out[1] += U[1] * T[1] / N * expected / (N - 1.0);
    out[2] += a * d / N;
    out[3] += b * c / N;
  }
  *firstStratum = false;
}

// Sums to results: common odds ratio, chi-square with the continuity
// correction of 1/2, its upper-tail P-value on one degree of freedom.
void FinalizeMHCSums(double* out, bool invalidStratum) {
  if (invalidStratum) {
    out[0] = out[1] = out[3] = kNaN;
    out[2] = kNotTwoByTwo;
    return;
  }
  const double s = std::fabs(out[0]) - 0.5;
  const double chiSquare = s * (s / out[1]);
  out[0] = out[2] / out[3];
  out[1] = chiSquare;
  out[2] = v1::ChiSqPValue(chiSquare, 1.0, kAlternativeGreater);
  out[3] = 1.0;
}

}  // namespace qel
