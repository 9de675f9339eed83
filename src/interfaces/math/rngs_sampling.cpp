// Canonical form of a finite table and the alias tables of Vose's method.
#include "interfaces/math/rngs_sampling.h"

#include <qel/basic_types.h>

#include <algorithm>
#include <new>

namespace qel {
namespace v1 {

int CreatePseudoPmf(double const** values, double const** probabilities, unsigned* count) {
  const unsigned n = *count;
  const double* inValues = *values;
  const double* inProbabilities = *probabilities;
  unsigned* index = nullptr;
  unsigned* runStart = nullptr;
  double* sorted = nullptr;
  double* merged = nullptr;
  try {
    index = new unsigned[n];
    sorted = new double[n];
    std::copy(inValues, inValues + n, sorted);
    std::sort(sorted, sorted + n);
    // First member of each run of equal values in the sorted copy.
    std::generate(index, index + n, Sequencer<unsigned>(0));
    const unsigned d =
        static_cast<unsigned>(std::unique(index, index + n, CompareEqual<double>(sorted)) - index);
    if (d < n) {
      runStart = new unsigned[d];
      std::copy(index, index + d, runStart);
      double* distinct = new double[d];
      for (unsigned k = 0; k < d; ++k) distinct[k] = sorted[runStart[k]];
      delete[] sorted;
      sorted = distinct;
    }
    // The permutation that sorts the input values; only sums over runs of
    // equal values are taken from it, so stability does not matter.
    std::generate(index, index + n, Sequencer<unsigned>(0));
    std::sort(index, index + n, CompareLessThan<double>(inValues));
    merged = new double[d];
    if (d == n) {
      for (unsigned k = 0; k < n; ++k) merged[k] = inProbabilities[index[k]];
    } else {
      for (unsigned k = 0; k < d; ++k) {
        const unsigned end = k + 1 < d ? runStart[k + 1] : n;
        double sum = 0.0;
        for (unsigned j = runStart[k]; j < end; ++j) sum += inProbabilities[index[j]];
        merged[k] = sum;
      }
    }
    delete[] index;
    index = nullptr;
    delete[] runStart;
    runStart = nullptr;
    *values = sorted;
    *probabilities = merged;
    *count = d;
    return 0;
  } catch (const std::bad_alloc&) {
    delete[] index;
    delete[] runStart;
    delete[] sorted;
    delete[] merged;
    return qelFailOutOfMemory;
  }
}

SamplingWithReplace::SamplingWithReplace(double const* probabilities, unsigned count)
    : mBrng(nullptr), mAlias(nullptr), mThreshold(nullptr), mCount(count), mMsgCode(0) {
  Initialize(probabilities);
}

SamplingWithReplace::~SamplingWithReplace() {
  delete[] mAlias;
  delete[] mThreshold;
}

// Thresholds are the probabilities scaled by n over their sum, so that the
// average cell holds exactly 1. Cells below 1 fill the front of the work
// array, the others its back; each small cell is topped up from the first
// large one, which turns small (and joins the front) once it falls below 1.
void SamplingWithReplace::Initialize(double const* probabilities) {
  const unsigned n = mCount;
  delete[] mAlias;
  delete[] mThreshold;
  mAlias = nullptr;
  mThreshold = nullptr;
  unsigned* work = nullptr;
  try {
    work = new unsigned[n];
    mAlias = new unsigned[n];
    mThreshold = new double[n];
  } catch (const std::bad_alloc&) {
    delete[] work;
    delete[] mAlias;
    delete[] mThreshold;
    mAlias = nullptr;
    mThreshold = nullptr;
    mMsgCode = qelFailOutOfMemory;
    return;
  }
  // The most accurate sum: smallest terms first.
  std::copy(probabilities, probabilities + n, mThreshold);
  std::sort(mThreshold, mThreshold + n);
  double sum = 0.0;
  for (unsigned i = 0; i < n; ++i) sum += mThreshold[i];

  unsigned front = 0, back = n;
  for (unsigned i = 0; i < n; ++i) {
    mAlias[i] = i;  // closes the hole left by rounding: see below
    const double t = (n / sum) * probabilities[i];
    mThreshold[i] = t;
    if (t >= 1.0)
      work[--back] = i;
    else
      work[front++] = i;
  }
  unsigned small = front, large = back;
  for (unsigned i = 0; large < n && i < small; ++i) {
    const unsigned s = work[i], l = work[large];
    mAlias[s] = l;
    mThreshold[l] = (mThreshold[s] - 1.0) + mThreshold[l];
    if (mThreshold[l] < 1.0) {
      ++small;
      ++large;
    }
  }
  // A front cell can end a hair below 1 without an alias; it keeps its own
  // index as alias, so it returns itself either way.
  delete[] work;
}

}  // namespace v1
}  // namespace qel
