// Sort order and average ranks of a column.
#include <qel/basic_types.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <new>
#include <vector>

#include "interfaces/basic_statistics/utilities.h"

namespace qel {
namespace v1 {

void GetOrder(double const* x, unsigned int n, unsigned int* order) {
  std::generate(order, order + n, Sequencer<unsigned int>());
  // Less-than is no strict weak order once NaN is present, and sorting with
  // it would be undefined: the NaN indices go to the end first, and the rest
  // is sorted by value.
  unsigned int* const numbers =
      std::partition(order, order + n, [x](unsigned int i) { return !std::isnan(x[i]); });
  std::sort(order, numbers, CompareLessThan<double>(x));
}

int GetRank(double const* x, unsigned int n, double* rank) {
  try {
    std::vector<unsigned int> order(n);
    GetOrder(x, n, order.data());
    // A run of exactly equal values at 0-based positions p..p+m-1 shares the
    // rank p + (m+1)/2; NaN equals nothing, so each NaN is a run of one.
    unsigned int p = 0;
    while (p < n) {
      unsigned int m = 1;
      while (p + m < n && x[order[p + m]] == x[order[p]]) ++m;
      const double shared = m == 1 ? p + 1.0 : p + (m + 1) * 0.5;
      for (unsigned int j = p; j < p + m; ++j) rank[order[j]] = shared;
      p += m;
    }
    return qelOk;
  } catch (const std::bad_alloc&) {
    std::fill(rank, rank + n, std::numeric_limits<double>::quiet_NaN());
    return qelFailOutOfMemory;
  }
}

}  // namespace v1
}  // namespace qel
