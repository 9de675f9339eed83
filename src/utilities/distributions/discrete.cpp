// The discrete uniform distribution on the integers a to b, and finite
// distributions given as a table of values and probabilities.
#include <algorithm>
#include <cmath>
#include <map>

#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/discrete_rules.h"
#include "utilities/distributions/kernels.h"

namespace qel {

// --- Integer uniform ---------------------------------------------------------

// The number of points b - a + 1, formed in 64 bits: b - a overflows an int
// for bounds of opposite signs near the ends of its range.
static double pointCount(int a, int b) {
  return static_cast<double>(static_cast<long long>(b) - a + 1);
}

double mIntegerUniformPdf(double x, int a, int b) {
  double k;
  if (!discrete::massPoint(x, &k) || k < a || k > b) return 0.0;
  return 1.0 / pointCount(a, b);
}

// The upper tail P(X >= x) is the lower tail at the mirror image b - (x - a).
double mIntegerUniformCdf(double x, int a, int b, bool upperTail) {
  if (upperTail) x = b - (x - a);
  const double k = discrete::cdfPoint(x);
  if (k < a) return 0.0;
  if (k >= b) return 1.0;
  return (k - a + 1.0) / pointCount(a, b);
}

double mIntegerUniformInvCdf(double p, int a, int b) {
  if (p == 0.0) return a;
  if (p == 1.0) return b;
  // The smallest count j of points from a with j/n >= p; a + p n - 1 would
  // lose a tiny p n against a and fall below the support.
  const double n = pointCount(a, b);
  const double j = std::min(std::max(std::ceil(p * n), 1.0), n);
  return a + (j - 1.0);
}

// --- Finite tables -------------------------------------------------------------

double mDiscretePdf(double x, const std::map<double, double>& table) {
  const auto it = table.find(x);
  return it == table.end() ? 0.0 : it->second;
}

// Lower tail: the keys <= x; upper tail: the keys >= x, each summed in its
// own right, so that a point at x counts in both tails and a small upper
// tail keeps its digits. Rounding of the sum stays within [0, 1].
double mDiscreteCdf(double x, const std::map<double, double>& table, bool upperTail) {
  if (table.empty()) return mGetMissingValueCode();
  // The whole table lies on one side of x.
  if (upperTail ? x <= table.begin()->first : x >= table.rbegin()->first) return 1.0;
  double sum = 0.0;
  if (upperTail) {
    for (auto it = table.lower_bound(x); it != table.end(); ++it) sum += it->second;
  } else {
    for (auto it = table.begin(); it != table.end() && it->first <= x; ++it) sum += it->second;
  }
  return std::min(sum, 1.0);
}

double mDiscreteInvCdf(double p, const std::map<double, double>& table) {
  double sum = 0.0;
  for (const auto& entry : table) {
    sum += entry.second;
    if (sum >= p) return entry.first;
  }
  return mGetMissingValueCode();
}

double mDiscreteInvCdf(double p, const std::multimap<double, double>& cumulative) {
  const auto it = cumulative.lower_bound(p);
  return it == cumulative.end() ? mGetMissingValueCode() : it->second;
}

}  // namespace qel
