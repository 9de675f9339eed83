// Sample quantiles: the nine definitions of Hyndman, R. J. and Fan, Y.
// (1996), "Sample quantiles in statistical packages", The American
// Statistician 50, 361-365, and the median of sorted data.
//
// Every definition takes a position h = n*p + m (m depending on the type),
// splits it into its integer part g and fraction f, and reads the order
// statistics x[g-1] and x[g] (0-based). Indices are kept inside the array,
// which is how the paper's x(0) and x(n+1) are read: as x(1) and x(n).
#include <qel/basic_types.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <new>

#include "interfaces/basic_statistics/order_statistics.h"

namespace qel {
namespace v1 {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

// The order statistic at 0-based position i, kept inside the array.
struct SortedView {
  double const* x;
  long long n;
  double at(long long i) const { return x[i < 0 ? 0 : (i >= n ? n - 1 : i)]; }
  // Linear interpolation between x[g-1] and x[g]; x[0] for g = 0.
  double interpolate(long long g, double f) const {
    if (g <= 0) return x[0];
    if (g >= n) return x[n - 1];
    return (1.0 - f) * x[g - 1] + f * x[g];
  }
};

// h split with modf: g the integer part (truncated), f the fraction.
struct Position {
  long long g;
  double f;
};

Position split(double h) {
  double whole = 0.0;
  double f = std::modf(h, &whole);
  return {static_cast<long long>(whole), f};
}

// The frame common to the nine types: NaN for an empty sample or a
// probability outside [0, 1]; the extremes at 0 and 1; otherwise the rule.
template <class Rule>
void quantileFrame(double const* sorted, unsigned int n, double* quantiles,
                   double const* probabilities, unsigned int count, Rule rule) {
  SortedView view{sorted, static_cast<long long>(n)};
  for (unsigned int c = 0; c < count; ++c) {
    double p = probabilities[c];
    if (n == 0 || !(p >= 0.0 && p <= 1.0)) {
      quantiles[c] = kNaN;
    } else if (p == 0.0) {
      quantiles[c] = sorted[0];
    } else if (p == 1.0) {
      quantiles[c] = sorted[n - 1];
    } else {
      quantiles[c] = rule(view, static_cast<double>(n), p);
    }
  }
}

}  // namespace

// Inverse of the empirical distribution function.
void GetType1SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count) {
  quantileFrame(sorted, n, quantiles, probabilities, count,
                [](SortedView const& v, double size, double p) {
                  Position h = split(size * p);
                  return h.f > 0.0 ? v.at(h.g) : v.at(h.g - 1);
                });
}

// Empirical distribution function, averaging at the discontinuities.
void GetType2SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count) {
  quantileFrame(sorted, n, quantiles, probabilities, count,
                [](SortedView const& v, double size, double p) {
                  Position h = split(size * p);
                  return h.f > 0.0 ? v.at(h.g) : (v.at(h.g - 1) + v.at(h.g)) * 0.5;
                });
}

// Nearest even order statistic.
void GetType3SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count) {
  quantileFrame(sorted, n, quantiles, probabilities, count,
                [](SortedView const& v, double size, double p) {
                  Position h = split(size * p - 0.5);
                  bool even = h.g % 2 == 0;
                  return (h.f == 0.0 && even) ? v.at(h.g - 1) : v.at(h.g);
                });
}

// Linear interpolation of the empirical distribution function.
void GetType4SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count) {
  quantileFrame(sorted, n, quantiles, probabilities, count,
                [](SortedView const& v, double size, double p) {
                  Position h = split(size * p);
                  if (h.g == 0) return v.x[0];
                  // n*p < n for p < 1 in exact arithmetic; the index guard
                  // covers a product rounded up to n.
                  return (1.0 - h.f) * v.at(h.g - 1) + h.f * v.at(h.g);
                });
}

// Piecewise linear through the midpoints of the steps: m = 1/2.
void GetType5SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count) {
  quantileFrame(sorted, n, quantiles, probabilities, count,
                [](SortedView const& v, double size, double p) {
                  Position h = split(size * p + 0.5);
                  return v.interpolate(h.g, h.f);
                });
}

// p(k) = k / (n + 1), the mean of the uniform order statistic: m = p.
void GetType6SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count) {
  quantileFrame(sorted, n, quantiles, probabilities, count,
                [](SortedView const& v, double size, double p) {
                  Position h = split(size * p + p);
                  return v.interpolate(h.g, h.f);
                });
}

// p(k) = (k - 1) / (n - 1), the mode of the uniform order statistic: m = 1 - p.
void GetType7SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count) {
  quantileFrame(sorted, n, quantiles, probabilities, count,
                [](SortedView const& v, double size, double p) {
                  Position h = split(size * p + (1.0 - p));
                  return v.interpolate(h.g, h.f);
                });
}

// Approximately median-unbiased whatever the distribution: m = (p + 1) / 3.
void GetType8SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count) {
  quantileFrame(sorted, n, quantiles, probabilities, count,
                [](SortedView const& v, double size, double p) {
                  Position h = split(p * size + (p + 1.0) / 3.0);
                  return v.interpolate(h.g, h.f);
                });
}

// Approximately unbiased for the normal distribution (Blom): m = p/4 + 3/8.
void GetType9SampleQuantiles(double const* sorted, unsigned int n, double* quantiles,
                             double const* probabilities, unsigned int count) {
  quantileFrame(sorted, n, quantiles, probabilities, count,
                [](SortedView const& v, double size, double p) {
                  Position h = split(size * p + (p + 1.5) * 0.25);
                  return v.interpolate(h.g, h.f);
                });
}

std::vector<double> mSortedCopy(double const* x, unsigned int n) {
  std::vector<double> copy(x, x + n);
  std::sort(copy.begin(), copy.end());
  return copy;
}

int GetSampleQuantiles(double const* x, unsigned int n, int type, double* quantiles,
                       double const* probabilities, unsigned int count) {
  using Definition = void (*)(double const*, unsigned int, double*, double const*, unsigned int);
  static const Definition definitions[] = {
      GetType1SampleQuantiles, GetType2SampleQuantiles, GetType3SampleQuantiles,
      GetType4SampleQuantiles, GetType5SampleQuantiles, GetType6SampleQuantiles,
      GetType7SampleQuantiles, GetType8SampleQuantiles, GetType9SampleQuantiles};
  if (type < 1 || type > 9) return qelFailUnknownSelector;
  try {
    std::vector<double> sorted = mSortedCopy(x, n);
    definitions[type - 1](sorted.data(), n, quantiles, probabilities, count);
  } catch (std::bad_alloc const&) {
    std::fill(quantiles, quantiles + count, kNaN);
    return qelFailOutOfMemory;
  }
  return qelOk;
}

double GetTypicalMedian(double const* sorted, unsigned int n) {
  if (n == 0) return kNaN;
  Position h = split(n * 0.5);
  if (h.f > 0.0) return sorted[h.g];
  return 0.5 * (sorted[h.g > 0 ? h.g - 1 : 0] + sorted[h.g]);
}

}  // namespace v1
}  // namespace qel
