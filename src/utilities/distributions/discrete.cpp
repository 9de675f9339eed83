// The discrete uniform distribution on the integers a to b, and finite
// distributions given as a table of values and probabilities.
#include <cmath>
#include <map>

#include "utilities/distributions/kernels.h"
#include "utilities/distributions/discrete_rules.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {

// --- Integer uniform ---------------------------------------------------------

double mIntegerUniformPdf(double x, int a, int b) {
  double k;
  if (!discrete::massPoint(x, &k) || k < a || k > b) return 0.0;
  return 1.0 / (b - a + 1.0);
}

// The upper tail P(X >= x) is the lower tail at the mirror image b - (x - a).
double mIntegerUniformCdf(double x, int a, int b, bool upperTail) {
  if (upperTail) x = b - (x - a);
  const double k = discrete::cdfPoint(x);
  if (k < a) return 0.0;
  if (k >= b) return 1.0;
  return (k - a + 1.0) / (b - a + 1.0);
}

double mIntegerUniformInvCdf(double p, int a, int b) {
  if (p == 0.0) return a;
  if (p == 1.0) return b;
  return std::ceil(a + p * (b - a + 1.0) - 1.0);
}

// --- Finite tables -------------------------------------------------------------

double mDiscretePdf(double x, const std::map<double, double>& table) {
  const auto it = table.find(x);
  return it == table.end() ? 0.0 : it->second;
}

// Lower tail: the keys <= x. Upper tail: 1 minus the keys < x, so that a point
// at x counts in both tails.
double mDiscreteCdf(double x, const std::map<double, double>& table, bool upperTail) {
  if (table.empty()) return mGetMissingValueCode();
  if (upperTail) {
    if (x <= table.begin()->first) return 1.0;
    double below = 0.0;
    for (auto it = table.begin(); it != table.end() && it->first < x; ++it) below += it->second;
    return 1.0 - below;
  }
  if (x > table.rbegin()->first) return 1.0;
  double sum = 0.0;
  for (auto it = table.begin(); it != table.end() && it->first <= x; ++it) sum += it->second;
  return sum;
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
