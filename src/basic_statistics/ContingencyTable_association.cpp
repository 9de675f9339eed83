// Measures of association on a table: Cohen's kappa over matched levels,
// Pearson's r and Spearman's rho with the counts as weights, and Goodman and
// Kruskal's lambda and tau (proportional reduction in error).
#include <algorithm>
#include <cmath>
#include <limits>
#include <vector>

#include "basic_statistics/ContingencyTable.h"
#include "interfaces/basic_statistics/utilities.h"

namespace qel {

namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

// Weighted means, sums of squares and cross-product in one pass (West,
// CACM 22 (1979) 532), every accumulator compensated. A point of weight w
// moves each mean by the fraction f = w / W' of its distance, W' being the
// weight with it.
class WeightedMoments {
 public:
  void add(double x, double y, double w) {
    const double next = weight_ + w;
    const double f = next == 0.0 ? 0.0 : w / next;
    const double dy = y - meanY_.sum;
    meanY_.add(dy * f);
    sumSqY_.add(dy * f * (weight_ * dy));
    const double dx = x - meanX_.sum;
    meanX_.add(f * dx);
    sumSqX_.add(f * dx * (weight_ * dx));
    crossXY_.add(dy * (weight_ * f * dx));
    weight_ = next;
  }

  double correlation() const {
    const double sxy = crossXY_.sum;
    const double sign = sxy > 0.0 ? 1.0 : (sxy < 0.0 ? -1.0 : 0.0);
    return sign * std::sqrt(sxy * sxy / (sumSqY_.sum * sumSqX_.sum));
  }

 private:
  double weight_ = 0.0;
  v1::CompensatedSum meanX_, meanY_, sumSqX_, sumSqY_, crossXY_;
};

// Midrank scores of the levels of a margin: all earlier totals plus half of
// the level's own.
std::vector<double> midranks(double const* totals, unsigned n) {
  std::vector<double> scores(n);
  double before = 0.0;
  for (unsigned i = 0; i < n; ++i) {
    scores[i] = before + 0.5 * totals[i];
    before += totals[i];
  }
  return scores;
}

double largestOf(double const* x, unsigned n) {
  return n == 0 ? 0.0 : *std::max_element(x, x + n);
}

}  // namespace

// The marks walk the two margins together: -1.0 steps over a row level,
// 1.0 over a column level, anything else pairs the current levels as a
// diagonal cell. The walk stops at the end of either margin.
void GetCohenKappa(TableColumns o, double const* T, double const* U, double const* marks,
                   double* out, double N, unsigned C, unsigned R, unsigned markCount,
                   unsigned mask) {
  if (!isRequested(mask, kTableKappa, out)) return;
  if (marks == nullptr && markCount != 0) {
    *out = kNaN;
    return;
  }
  double agreed = 0.0, chance = 0.0;
  unsigned c = 0, r = 0;
  for (unsigned i = 0; i < markCount && c < C && r < R; ++i) {
    if (marks[i] == -1.0) {
      ++r;
    } else if (marks[i] == 1.0) {
      ++c;
    } else {
      agreed += o[c][r];
      chance += T[c] * U[r];
      ++c;
      ++r;
    }
  }
  const double p = agreed / N;
  const double q = chance / (N * N);
  *out = (p - q) / (1.0 - q);
}

// Scores are the 0-based level indices, so the levels count as equally
// spaced; only cells with a positive count enter.
void GetPearsonR(TableColumns o, double* out, double N, unsigned C, unsigned R, unsigned mask) {
  if (!isRequested(mask, kTablePearsonR, out)) return;
  if (!(N > 1.0)) {
    *out = kNaN;
    return;
  }
  WeightedMoments moments;
  for (unsigned c = 0; c < C; ++c) {
    for (unsigned r = 0; r < R; ++r) {
      if (o[c][r] > 0.0) moments.add(c, r, o[c][r]);
    }
  }
  *out = moments.correlation();
}

// The same correlation on midrank scores: Spearman's rho of the data that
// the table counts, with ties at the levels.
void GetSpearmanRho(TableColumns o, double const* T, double const* U, double* out, double N,
                    unsigned C, unsigned R, unsigned mask) {
  if (!isRequested(mask, kTableSpearmanRho, out)) return;
  if (!(N > 1.0)) {
    *out = kNaN;
    return;
  }
  const std::vector<double> columnScore = midranks(T, C);
  const std::vector<double> rowScore = midranks(U, R);
  WeightedMoments moments;
  for (unsigned c = 0; c < C; ++c) {
    for (unsigned r = 0; r < R; ++r) moments.add(columnScore[c], rowScore[r], o[c][r]);
  }
  *out = moments.correlation();
}

// Goodman and Kruskal (1954): lambda compares the errors of guessing the
// modal level with and without knowing the other variable; tau does the
// same for guessing in proportion to the margins.
void GetGoodmanKruskalPRE(TableColumns o, double const* T, double const* U, double* out, double N,
                          unsigned C, unsigned R, unsigned mask) {
  if (!isRequested(mask, kTableGoodmanKruskal, out)) return;
  std::vector<double> rowLargest(R, -std::numeric_limits<double>::infinity());
  std::vector<double> rowSquares(R, 0.0);
  double A = 0.0, P = 0.0, ST = 0.0;
  for (unsigned c = 0; c < C; ++c) {
    double squares = 0.0;
    for (unsigned r = 0; r < R; ++r) {
      const double x = o[c][r];
      squares += x * x;
      rowSquares[r] += x * x;
      rowLargest[r] = std::max(rowLargest[r], x);
    }
    A += largestOf(o[c], R);
    if (T[c] > 0.0) P += squares / T[c];
    ST += T[c] * T[c];
  }
  double B = 0.0, Q = 0.0, SU = 0.0;
  for (unsigned r = 0; r < R; ++r) {
    B += C == 0 ? 0.0 : rowLargest[r];
    if (U[r] > 0.0) Q += rowSquares[r] / U[r];
    SU += U[r] * U[r];
  }
  const double Tmax = largestOf(T, C), Umax = largestOf(U, R);
  out[0] = (A - Umax) / (N - Umax);
  out[1] = (B - Tmax) / (N - Tmax);
  out[2] = (N * P - SU) / (N * N - SU);
  out[3] = (N * Q - ST) / (N * N - ST);
}

}  // namespace qel
