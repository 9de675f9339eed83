// Trimmed means of sorted data: the library's fixed 5% rule, the trimmed
// mean of whole observations and the form with fractional end weights. The
// kept observations are averaged with the compensated updating mean.
#include <qel/basic_types.h>
#include <qel/descriptive.h>

#include <cmath>
#include <limits>
#include <new>

#include "interfaces/basic_statistics/order_statistics.h"

namespace qel {
namespace v1 {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

// Mean of sorted[k .. n-k-1]; NaN when 2k >= n. k is a double so that a
// huge or NaN trim count cannot wrap around.
double meanOfMiddle(double const* sorted, unsigned int n, double k) {
  if (!(k >= 0.0) || 2.0 * k >= double(n)) return kNaN;
  unsigned int drop = static_cast<unsigned int>(k);
  return GetSampleMean(sorted + drop, n - 2 * drop);
}

// Copy, sort, trimmed mean; 30001 when the copy cannot be made.
template <class OnSorted>
double trimmedMeanOfCopy(double const* x, unsigned int n, int* status, OnSorted onSorted) {
  if (status) *status = qelOk;
  if (n == 0) return kNaN;
  try {
    std::vector<double> sorted = mSortedCopy(x, n);
    return onSorted(sorted.data());
  } catch (std::bad_alloc const&) {
    if (status) *status = qelFailOutOfMemory;
    return kNaN;
  }
}

}  // namespace

double LynTrimmedMeanOnSorted(double const* sorted, unsigned int n) {
  // Five percent at each end, rounded to the nearest observation, halves up.
  return meanOfMiddle(sorted, n, std::trunc(0.05 * n + 0.5));
}

double TrimmedMeanOnSorted(double const* sorted, unsigned int n, double trim) {
  return meanOfMiddle(sorted, n, std::trunc(n * trim));
}

double LynTrimmedMeanOnSorted(double const* sorted, unsigned int n, double trim) {
  double h = n * trim;
  double whole = std::trunc(h);
  if (!(whole >= 0.0) || 2.0 * whole >= double(n)) return kNaN;
  unsigned int g = static_cast<unsigned int>(whole);
  double endWeight = 1.0 - (h - whole);  // weight of each partly dropped end
  unsigned int m = n - 2 * g - 1;        // index of the last kept one, from g
  if (m == 0) return sorted[g];
  // Weighted updating mean with a compensating carry (Kahan): the first
  // observation weighs endWeight, the inner ones 1, the last endWeight.
  double mean = sorted[g], weight = endWeight, carry = 0.0;
  for (unsigned int i = g + 1; i < g + m; ++i) {
    weight += 1.0;
    double step = (sorted[i] - mean) / weight + carry;
    double next = mean + step;
    carry = step - (next - mean);
    mean = next;
  }
  weight += endWeight;
  return mean + (carry + (sorted[g + m] - mean) * endWeight / weight);
}

double GetLynTrimmedMean(double const* x, unsigned int n, int* status) {
  return trimmedMeanOfCopy(x, n, status,
                           [n](double const* sorted) { return LynTrimmedMeanOnSorted(sorted, n); });
}

double GetTrimmedMean(double const* x, unsigned int n, double trim, int* status) {
  return trimmedMeanOfCopy(x, n, status, [n, trim](double const* sorted) {
    return TrimmedMeanOnSorted(sorted, n, trim);
  });
}

}  // namespace v1
}  // namespace qel
