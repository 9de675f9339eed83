// Sampling with replacement from a finite table in constant time per draw:
// Walker's alias method (Walker 1977, ACM TOMS 3) in Vose's single-array form
// (Vose 1991, IEEE Trans. Software Eng. 17), after the table of values and
// probabilities has been brought to canonical form (sorted by value, equal
// values merged). Probabilities are relative weights: they need not sum to 1.
#ifndef QEL_SRC_INTERFACES_MATH_RNGS_SAMPLING_H
#define QEL_SRC_INTERFACES_MATH_RNGS_SAMPLING_H

#include "interfaces/math/rngs.h"

namespace qel {
namespace v1 {

// Each call returns the counter, then adds one (fills 0, 1, 2, ...).
template <class T>
class Sequencer {
 public:
  explicit Sequencer(T start = T()) : mNext(start) {}
  T operator()() { return mNext++; }

 private:
  T mNext;
};

// Compares two indices by the array elements they name.
template <class T>
class CompareLessThan {
 public:
  explicit CompareLessThan(const T* array) : mArray(array) {}
  bool operator()(unsigned i, unsigned j) const { return mArray[i] < mArray[j]; }

 private:
  const T* mArray;
};

template <class T>
class CompareEqual {
 public:
  explicit CompareEqual(const T* array) : mArray(array) {}
  bool operator()(unsigned i, unsigned j) const { return mArray[i] == mArray[j]; }

 private:
  const T* mArray;
};

// Replaces *values, *probabilities and *count by new new[] arrays sorted by
// value with equal values merged (their probabilities summed), and the new
// count. The caller's arrays are not touched; the caller frees the new ones.
// Returns 0, or 30001 when memory fails (the three items are then unchanged).
int CreatePseudoPmf(double const** values, double const** probabilities, unsigned* count);

class SamplingWithReplace {
 public:
  SamplingWithReplace(double const* probabilities, unsigned count);
  SamplingWithReplace(const SamplingWithReplace&) = delete;
  SamplingWithReplace& operator=(const SamplingWithReplace&) = delete;
  ~SamplingWithReplace();

  void SetBrng(CmUniformGenerator* brng) { mBrng = brng; }
  int GetMsgCode() const { return mMsgCode; }
  // One draw: the index of an outcome. One uniform, one floor, one
  // comparison, at most two reads.
  unsigned GetValue() const {
    const double x = mBrng->mGetRandom() * mCount;
    const unsigned k = static_cast<unsigned>(x);
    return k + 1.0 > x + mThreshold[k] ? mAlias[k] : k;
  }
  void Initialize(double const* probabilities);

 private:
  CmUniformGenerator* mBrng;
  unsigned* mAlias;
  double* mThreshold;
  unsigned mCount;
  int mMsgCode;
};

}  // namespace v1
}  // namespace qel

#endif
