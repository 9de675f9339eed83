// Plain, running and relative sums with Kahan's compensation (Kahan, CACM 8
// (1965) 40), and the count of 0/1 events.
#include <limits>

#include "interfaces/basic_statistics/utilities.h"

namespace qel {
namespace v1 {

namespace {

// The sum used by GetSum and GetProportions, for n >= 1. The loop takes the
// elements two at a time; an odd last element joins the carry, and the carry
// the sum, in plain arithmetic. The carry of the pairs is therefore folded in
// only when n is odd.
double compensatedSum(double const* x, unsigned int n) {
  CompensatedSum s;
  unsigned int i = 0;
  for (; i + 1 < n; i += 2) {
    s.add(x[i]);
    s.add(x[i + 1]);
  }
  if (i < n) {
    s.carry += x[i];
    s.sum += s.carry;
  }
  return s.sum;
}

}  // namespace

double GetSum(double const* x, unsigned int n) {
  if (n == 0) return std::numeric_limits<double>::quiet_NaN();
  return compensatedSum(x, n);
}

void GetCumulativeSums(double const* x, unsigned int n, double* out) {
  CompensatedSum s;
  for (unsigned int i = 0; i < n; ++i) {
    s.add(x[i]);  // x[i] is read before out[i] is written: out may be x
    out[i] = s.sum;
  }
}

void GetProportions(double const* x, unsigned int n, double* out) {
  if (n == 0) return;
  const double total = compensatedSum(x, n);
  for (unsigned int i = 0; i < n; ++i) out[i] = x[i] / total;
}

unsigned int GetEventCount(int const* x, unsigned int n) {
  unsigned int count = 0;
  for (unsigned int i = 0; i < n; ++i) count += x[i];
  return count;
}

}  // namespace v1
}  // namespace qel
