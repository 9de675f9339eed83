// The mode: the values of the longest runs of exactly equal observations in
// sorted data, with a fixed number of slots for ties between runs.
#include <qel/basic_types.h>

#include <algorithm>
#include <limits>
#include <new>

#include "interfaces/basic_statistics/order_statistics.h"

namespace qel {
namespace v1 {

void ResetMode(double* modes, unsigned int capacity, unsigned int* modeCount,
               unsigned int* frequency) {
  if (modes) std::fill(modes, modes + capacity, std::numeric_limits<double>::quiet_NaN());
  if (modeCount) *modeCount = 0;
  if (frequency) *frequency = 0;
}

unsigned int ModeOnSorted(double const* sorted, unsigned int n, double* modes,
                          unsigned int capacity, unsigned int* frequency) {
  unsigned int stored = 0;
  unsigned int best = 0;  // longest run length minus one; 0: nothing repeats
  unsigned int i = 0;
  while (i < n) {
    unsigned int j = i + 1;
    while (j < n && sorted[j] == sorted[i]) ++j;  // NaN never joins a run
    unsigned int repeats = j - i - 1;
    if (repeats > 0 && repeats > best) {
      best = repeats;
      stored = 0;
      if (capacity > 0) modes[stored++] = sorted[i];
    } else if (repeats > 0 && repeats == best && stored < capacity) {
      modes[stored++] = sorted[i];
    }
    i = j;
  }
  if (frequency) *frequency = best > 0 ? best + 1 : 0;
  if (modes) std::fill(modes + stored, modes + capacity, std::numeric_limits<double>::quiet_NaN());
  return stored;
}

int GetMode(double const* x, unsigned int n, double* modes, unsigned int capacity,
            unsigned int* modeCount, unsigned int* frequency) {
  if (n == 0 || capacity == 0) {
    ResetMode(modes, capacity, modeCount, frequency);
    return qelOk;
  }
  try {
    std::vector<double> sorted = mSortedCopy(x, n);
    unsigned int found = ModeOnSorted(sorted.data(), n, modes, capacity, frequency);
    if (modeCount) *modeCount = found;
  } catch (std::bad_alloc const&) {
    ResetMode(modes, capacity, modeCount, frequency);
    return qelFailOutOfMemory;
  }
  return qelOk;
}

}  // namespace v1
}  // namespace qel
