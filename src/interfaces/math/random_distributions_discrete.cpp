// The exported discrete distribution on a table of values and probabilities.
// Bare frame: no floating-point state change and no missing-value
// translation. The table is built as a map from value to probability on
// every scalar call (once per array call), in the order of the arrays, so
// that the first occurrence of a repeated value wins.
#include <qel/distributions.h>

#include <map>

#include "utilities/distributions/kernels.h"

namespace qel {

namespace {

std::map<double, double> makeTable(const double* values, const double* probabilities, int size) {
  std::map<double, double> table;
  for (int i = 0; i < size; ++i) table.insert({values[i], probabilities[i]});
  return table;
}

}  // namespace

double DiscretePdf(double x, const double* values, const double* probabilities, int size) {
  return mDiscretePdf(x, makeTable(values, probabilities, size));
}

double DiscreteCdf(double x, const double* values, const double* probabilities, int size,
                   bool upperTail) {
  return mDiscreteCdf(x, makeTable(values, probabilities, size), upperTail);
}

double DiscreteInvCdf(double p, const double* values, const double* probabilities, int size) {
  return mDiscreteInvCdf(p, makeTable(values, probabilities, size));
}

void DiscretePdf(double* out, const double* x, unsigned long count, const double* values,
                 const double* probabilities, int size) {
  const auto table = makeTable(values, probabilities, size);
  for (unsigned long i = 0; i < count; ++i) out[i] = mDiscretePdf(x[i], table);
}

void DiscreteCdf(double* out, const double* x, unsigned long count, const double* values,
                 const double* probabilities, int size, bool upperTail) {
  const auto table = makeTable(values, probabilities, size);
  for (unsigned long i = 0; i < count; ++i) out[i] = mDiscreteCdf(x[i], table, upperTail);
}

void DiscreteInvCdf(double* out, const double* p, unsigned long count, const double* values,
                    const double* probabilities, int size) {
  const auto table = makeTable(values, probabilities, size);
  for (unsigned long i = 0; i < count; ++i) out[i] = mDiscreteInvCdf(p[i], table);
}

}  // namespace qel
