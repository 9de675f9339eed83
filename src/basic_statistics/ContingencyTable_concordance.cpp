// Measures of concordance of an ordered table: concordant and discordant
// pairs, Somers' d in both directions, Goodman and Kruskal's gamma, Kendall's
// tau-b and a z statistic for the test of no association.
//
// The pair counts need, for every cell, the sum of the cells to its lower
// right and to its upper right. Sweeping the columns from the last to the
// first with the row-wise sums of the columns already passed gives both in
// O(R) per column, O(RC) in all, instead of the O(R^2 C^2) of the double
// sum over cell pairs.
#include <cmath>
#include <vector>

#include "basic_statistics/ContingencyTable.h"
#include "interfaces/basic_statistics/utilities.h"

namespace qel {

namespace {

struct PairCounts {
  double concordant;
  double discordant;
};

PairCounts countPairs(TableColumns o, unsigned C, unsigned R) {
  // right[r]: sum over the columns after the current one, row r.
  std::vector<double> right(R, 0.0);
  // above[r]: sum of right[r'] over r' > r.
  std::vector<double> above(R, 0.0);
  v1::CompensatedSum concordant, discordant;
  for (unsigned c = C; c-- > 0;) {
    double tail = 0.0;
    for (unsigned r = R; r-- > 0;) {
      above[r] = tail;
      tail += right[r];
    }
    double head = 0.0;  // sum of right[r'] over r' < r
    double const* column = o[c];
    for (unsigned r = 0; r < R; ++r) {
      const double x = column[r];
      if (x != 0.0) {
        concordant.add(x * above[r]);
        discordant.add(x * head);
      }
      head += right[r];
    }
    for (unsigned r = 0; r < R; ++r) right[r] += column[r];
  }
  return {concordant.sum, discordant.sum};
}

// sum of (t - 1) t / 2 and sum of t^3 over the totals of one margin.
void marginSums(double const* totals, unsigned n, double* tiedPairs, double* cubes) {
  double pairs = 0.0, cubed = 0.0;
  for (unsigned i = 0; i < n; ++i) {
    const double t = totals[i];
    pairs += (t - 1.0) * t;
    cubed += t * t * t;
  }
  *tiedPairs = pairs * 0.5;
  *cubes = cubed;
}

}  // namespace

void GetConcordanceMeasures(TableColumns o, double const* T, double const* U, double* out, double N,
                            unsigned C, unsigned R, unsigned mask) {
  if (!isRequested(mask, kTableMeasuresOfConcordance, out)) return;
  const PairCounts counts = countPairs(o, C, R);
  const double P = counts.concordant, Q = counts.discordant;
  const double pairs = (N - 1.0) * N * 0.5;
  double columnTies, columnCubes, rowTies, rowCubes;
  marginSums(T, C, &columnTies, &columnCubes);
  marginSums(U, R, &rowTies, &rowCubes);
  const double D = P - Q;
  const double X0 = pairs - columnTies;  // pairs not tied on the column variable
  const double Y0 = pairs - rowTies;     // pairs not tied on the row variable
  const double N3 = N * N * N;
  out[0] = P;
  out[1] = Q;
  out[2] = pairs - P - Q;
  out[3] = pairs;
  out[4] = D / X0;
  out[5] = D / Y0;
  out[6] = D / (P + Q);
  out[7] = D / std::sqrt(Y0 * X0);
  out[8] = D / std::sqrt((N3 - rowCubes) * (N3 - columnCubes) / (9.0 * N3));
}

}  // namespace qel
