// The exported discrete distribution on a table of values and probabilities.
// Bare frame: no floating-point state change and no missing-value
// translation. The table is built as a map from value to probability on
// every scalar call (once per array call), in the order of the arrays, so
// that the first occurrence of a repeated value wins.
//
// A table is a distribution only if it has at least one entry, finite values
// and probabilities in [0, 1] that add up to 1 within rounding; any other
// table (empty, null, NaN) answers NaN. The missing value never leaves.
#include <qel/distributions.h>

#include <cmath>
#include <map>

#include "interfaces/math/domains.h"
#include "utilities/distributions/kernels.h"

namespace qel {

namespace {

// Probabilities that add up to 1 within this many units of rounding.
constexpr double kTotalTolerance = 1e-9;

// The table, or an empty one when the arrays are no distribution.
std::map<double, double> makeTable(const double* values, const double* probabilities, int size) {
  std::map<double, double> table;
  if (size <= 0 || values == nullptr || probabilities == nullptr) return table;
  double total = 0.0;
  for (int i = 0; i < size; ++i) {
    if (!domain::finite(values[i]) || !domain::probability(probabilities[i])) return {};
    // A repeated value keeps its first probability, and only that counts.
    if (table.insert({values[i], probabilities[i]}).second) total += probabilities[i];
  }
  if (!(std::fabs(total - 1.0) <= kTotalTolerance)) return {};
  return table;
}

double answer(double value) {
  if (mIsNumericMissing(value) || std::isnan(value)) return mQuietNaN();
  return value;
}

double pdf(double x, const std::map<double, double>& table) {
  if (table.empty() || std::isnan(x)) return mQuietNaN();
  return mDiscretePdf(x, table);
}

double cdf(double x, const std::map<double, double>& table, bool upperTail) {
  if (table.empty() || std::isnan(x) || mIsNumericMissing(x)) return mQuietNaN();
  return answer(mDiscreteCdf(x, table, upperTail));
}

double inverse(double p, const std::map<double, double>& table) {
  if (table.empty() || !domain::probability(p)) return mQuietNaN();
  return answer(mDiscreteInvCdf(p, table));
}

}  // namespace

double DiscretePdf(double x, const double* values, const double* probabilities, int size) {
  return pdf(x, makeTable(values, probabilities, size));
}

double DiscreteCdf(double x, const double* values, const double* probabilities, int size,
                   bool upperTail) {
  return cdf(x, makeTable(values, probabilities, size), upperTail);
}

double DiscreteInvCdf(double p, const double* values, const double* probabilities, int size) {
  return inverse(p, makeTable(values, probabilities, size));
}

void DiscretePdf(double* out, const double* x, unsigned long count, const double* values,
                 const double* probabilities, int size) {
  const auto table = makeTable(values, probabilities, size);
  for (unsigned long i = 0; i < count; ++i) out[i] = pdf(x[i], table);
}

void DiscreteCdf(double* out, const double* x, unsigned long count, const double* values,
                 const double* probabilities, int size, bool upperTail) {
  const auto table = makeTable(values, probabilities, size);
  for (unsigned long i = 0; i < count; ++i) out[i] = cdf(x[i], table, upperTail);
}

void DiscreteInvCdf(double* out, const double* p, unsigned long count, const double* values,
                    const double* probabilities, int size) {
  const auto table = makeTable(values, probabilities, size);
  for (unsigned long i = 0; i < count; ++i) out[i] = inverse(p[i], table);
}

}  // namespace qel
