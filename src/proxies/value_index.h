// An open-addressing hash from double values to dense ids 0, 1, 2, ... in
// order of first insertion. Values are equal as the distinct-value map has
// them: exactly, with -0 equal to 0 and every NaN equal to every other. It
// lets a pass over millions of rows look values up in a flat table rather
// than walk a tree.
#ifndef QEL_SRC_PROXIES_VALUE_INDEX_H
#define QEL_SRC_PROXIES_VALUE_INDEX_H

#include <cmath>
#include <cstdint>
#include <cstring>
#include <limits>
#include <vector>

namespace qel {

class CmValueIndex {
 public:
  CmValueIndex() : mKeys(16), mIds(16, -1), mCount(0) {}

  // The id of value, a new one (the count so far) if it was absent.
  int mFindOrInsert(double value, bool* inserted) {
    if (2 * (mCount + 1) > mIds.size()) mGrow();
    const std::uint64_t key = mKeyOf(value);
    std::size_t slot = mSlotOf(key);
    while (mIds[slot] >= 0) {
      if (mKeys[slot] == key) {
        *inserted = false;
        return mIds[slot];
      }
      slot = (slot + 1) & (mIds.size() - 1);
    }
    mKeys[slot] = key;
    mIds[slot] = static_cast<int>(mCount++);
    *inserted = true;
    return mIds[slot];
  }

  // The id of value, or -1.
  int mFind(double value) const {
    const std::uint64_t key = mKeyOf(value);
    for (std::size_t slot = mSlotOf(key);; slot = (slot + 1) & (mIds.size() - 1)) {
      if (mIds[slot] < 0) return -1;
      if (mKeys[slot] == key) return mIds[slot];
    }
  }

  std::size_t mSize() const { return mCount; }

 private:
  static std::uint64_t mKeyOf(double value) {
    if (value == 0.0) value = 0.0;
    if (std::isnan(value)) value = std::numeric_limits<double>::quiet_NaN();
    std::uint64_t bits;
    std::memcpy(&bits, &value, sizeof bits);
    return bits;
  }
  // The finaliser of MurmurHash3: every bit of the key reaches the slot.
  std::size_t mSlotOf(std::uint64_t key) const {
    key ^= key >> 33;
    key *= 0xff51afd7ed558ccdULL;
    key ^= key >> 33;
    key *= 0xc4ceb9fe1a85ec53ULL;
    key ^= key >> 33;
    return static_cast<std::size_t>(key) & (mIds.size() - 1);
  }
  void mGrow() {
    std::vector<std::uint64_t> keys(2 * mKeys.size());
    std::vector<int> ids(2 * mIds.size(), -1);
    keys.swap(mKeys);
    ids.swap(mIds);
    for (std::size_t i = 0; i < ids.size(); ++i) {
      if (ids[i] < 0) continue;
      std::size_t slot = mSlotOf(keys[i]);
      while (mIds[slot] >= 0) slot = (slot + 1) & (mIds.size() - 1);
      mKeys[slot] = keys[i];
      mIds[slot] = ids[i];
    }
  }

  std::vector<std::uint64_t> mKeys;
  std::vector<int> mIds;
  std::size_t mCount;
};

}  // namespace qel

#endif
