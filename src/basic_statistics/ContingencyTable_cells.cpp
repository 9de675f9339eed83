// Results cell by cell: percentages of the margins and of the grand total,
// and the residuals of the observed counts from the expected ones. None of
// these tests a denominator: an empty margin gives what IEEE arithmetic
// gives (an infinity or NaN), which the host reads as "no value".
#include <cmath>

#include "basic_statistics/ContingencyTable.h"

namespace qel {

namespace {

// out[c][r] = cell(c, r) over every cell of the table whose output column
// was lent.
template <class Cell>
void forEachCell(TableOutput out, unsigned C, unsigned R, Cell cell) {
  if (out == nullptr) return;
  for (unsigned c = 0; c < C; ++c) {
    double* column = out[c];
    if (column == nullptr) continue;
    for (unsigned r = 0; r < R; ++r) column[r] = cell(c, r);
  }
}

}  // namespace

void GetColumnPercentages(TableColumns o, TableOutput out, double const* T, unsigned C, unsigned R,
                          unsigned mask) {
  if (!isRequested(mask, kTableColumnPercentages, out)) return;
  forEachCell(out, C, R, [&](unsigned c, unsigned r) { return o[c][r] * (100.0 / T[c]); });
}

void GetRowPercentages(TableColumns o, TableOutput out, double const* U, unsigned C, unsigned R,
                       unsigned mask) {
  if (!isRequested(mask, kTableRowPercentages, out)) return;
  forEachCell(out, C, R, [&](unsigned c, unsigned r) { return (100.0 / U[r]) * o[c][r]; });
}

void GetPercentages(TableColumns o, TableOutput out, double N, unsigned C, unsigned R,
                    unsigned mask) {
  if (!isRequested(mask, kTablePercentages, out)) return;
  const double scale = 100.0 / N;
  forEachCell(out, C, R, [&](unsigned c, unsigned r) { return o[c][r] * scale; });
}

void GetColumnTotalPercentages(double const* T, double* out, double N, unsigned C, unsigned mask) {
  if (!isRequested(mask, kTableColumnTotalPercentages, out)) return;
  const double scale = 100.0 / N;
  for (unsigned c = 0; c < C; ++c) out[c] = T[c] * scale;
}

void GetRowTotalPercentages(double const* U, double* out, double N, unsigned R, unsigned mask) {
  if (!isRequested(mask, kTableRowTotalPercentages, out)) return;
  const double scale = 100.0 / N;
  for (unsigned r = 0; r < R; ++r) out[r] = U[r] * scale;
}

void GetRawResiduals(TableColumns o, TableColumns e, TableOutput out, unsigned C, unsigned R,
                     unsigned mask) {
  if (!isRequested(mask, kTableRawResiduals, out)) return;
  forEachCell(out, C, R, [&](unsigned c, unsigned r) { return o[c][r] - e[c][r]; });
}

void GetStandardizedResiduals(TableColumns o, TableColumns e, TableOutput out, unsigned C,
                              unsigned R, unsigned mask) {
  if (!isRequested(mask, kTableStandardizedResiduals, out)) return;
  forEachCell(out, C, R,
              [&](unsigned c, unsigned r) { return (o[c][r] - e[c][r]) / std::sqrt(e[c][r]); });
}

// Haberman's adjusted residual: the raw residual over its estimated standard
// error under independence, sqrt(e (1 - T/N) (1 - U/N)).
void GetAdjustedResiduals(TableColumns o, TableColumns e, TableOutput out, double const* T,
                          double const* U, double N, unsigned C, unsigned R, unsigned mask) {
  if (!isRequested(mask, kTableAdjustedResiduals, out)) return;
  forEachCell(out, C, R, [&](unsigned c, unsigned r) {
    const double variance = (1.0 - T[c] / N) * e[c][r] * (1.0 - U[r] / N);
    return (o[c][r] - e[c][r]) / std::sqrt(variance);
  });
}

void GetChisquareContributions(TableColumns o, TableColumns e, TableOutput out, unsigned C,
                               unsigned R, unsigned mask) {
  if (!isRequested(mask, kTableChisquareContributions, out)) return;
  forEachCell(out, C, R, [&](unsigned c, unsigned r) {
    const double d = o[c][r] - e[c][r];
    return d * (d / e[c][r]);
  });
}

}  // namespace qel
