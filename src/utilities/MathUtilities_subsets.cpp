// Enumeration of k-subsets, with and without replacement.
#include <cmath>

#include "utilities/MathUtilities.h"
#include "utilities/higher_functions/transcendental.h"

namespace qel {

CmSubsetsOfNChooseK::CmSubsetsOfNChooseK() : mN(0), mK(0), mCount(0), mIndex(0) {}
CmSubsetsOfNChooseK::~CmSubsetsOfNChooseK() {}

int CmSubsetsOfNChooseK::mInitialize(int n, int k) {
  mN = n;
  mK = k;
  mSubset.resize(k > 0 ? k : 0);
  for (int i = 0; i < k; ++i) mSubset[i] = i;
  mIndex = 0;
  mCount = mNChooseK(n, k);
  return mCount;
}

void CmSubsetsOfNChooseK::mNextSubset(std::vector<int>& out) {
  ++mIndex;
  if (mIndex > mCount) return;
  out = mSubset;
  if (mIndex == mCount) return;
  // The rightmost element that can still grow grows by one; the elements to
  // its right follow it consecutively.
  int i = mK - 1;
  while (i >= 0 && mSubset[i] == mN - mK + i) --i;
  if (i < 0) return;
  ++mSubset[i];
  for (int j = i + 1; j < mK; ++j) mSubset[j] = mSubset[j - 1] + 1;
}

CmSubsetsOfNChooseKWithReplacement::CmSubsetsOfNChooseKWithReplacement()
    : mN(0), mK(0), mCount(0), mIndex(0) {}
CmSubsetsOfNChooseKWithReplacement::~CmSubsetsOfNChooseKWithReplacement() {}

int CmSubsetsOfNChooseKWithReplacement::mInitialize(int n, int k) {
  mN = n;
  mK = k;
  mSubset.assign(k > 0 ? k : 0, 0);
  mIndex = 0;
  // The number of multisets, C(n + k - 1, k).
  mCount = static_cast<int>(
      mNearestInteger(mExponential(mLogGamma(n + k) - mLogGamma(k + 1.0) - mLogGamma(n), true)));
  return mCount;
}

bool CmSubsetsOfNChooseKWithReplacement::mAdvance() {
  int i = mK - 1;
  while (i >= 0 && mSubset[i] == mN - 1) --i;
  if (i < 0) return false;
  ++mSubset[i];
  for (int j = i + 1; j < mK; ++j) mSubset[j] = mSubset[i];
  return true;
}

void CmSubsetsOfNChooseKWithReplacement::mNextSubset(std::vector<int>& out) {
  ++mIndex;
  if (mIndex > mCount) return;
  if (mIndex <= mN) {
    // The constant sequences come first: (i, ..., i) for i = 0 .. n-1.
    out.assign(mK, mIndex - 1);
    if (mIndex == mN) mSubset.assign(mK, 0);
    return;
  }
  // Then the non-decreasing sequences in lexicographic order, skipping the
  // constant ones, which were delivered already.
  do {
    if (!mAdvance()) return;
  } while (mK > 0 && mSubset.front() == mSubset.back());
  out = mSubset;
}

}  // namespace qel
