// Ranges over row sets and element-wise vector work.
#include <algorithm>
#include <cfloat>
#include <cstddef>

#include "proxies/rows.h"
#include "utilities/CheckedFunctions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"

namespace qel {

namespace {

// The running range of a scan; the missing value (and NaN, which fails both
// comparisons) leaves it alone. The missing value is compared inline: this
// is the inner loop over up to millions of rows.
struct Range {
  double lo = DBL_MAX, hi = -DBL_MAX;
  const double missing = mGetMissingValueCode();
  void widen(double v) {
    if (v == missing) return;
    lo = v < lo ? v : lo;
    hi = v > hi ? v : hi;
  }
  void store(double* min, double* max) const {
    const bool none = lo == DBL_MAX;
    *min = none ? missing : lo;
    *max = none ? missing : hi;
  }
};

}  // namespace

void mMinMax(const std::vector<double>& x, const CbRows& rows, double* min, double* max) {
  Range range;
  const int n = rows.mGetRowCt();
  const std::size_t size = x.size();
  if (rows.mIsUseAllRows()) {
    const std::size_t m = std::min(size, static_cast<std::size_t>(std::max(n, 0)));
    for (std::size_t i = 0; i < m; ++i) range.widen(x[i]);
  } else {
    for (int i = 0; i < n; ++i) {
      const int row = rows.mGetRow(i);
      if (row >= 1 && static_cast<std::size_t>(row) <= size) range.widen(x[row - 1]);
    }
  }
  range.store(min, max);
}

void mMinMax(const double* x, const CbRows& rows, double* min, double* max) {
  Range range;
  const int n = rows.mGetRowCt();
  if (rows.mIsUseAllRows()) {
    for (int i = 0; i < n; ++i) range.widen(x[i]);
  } else {
    for (int i = 0; i < n; ++i) range.widen(x[rows.mGetRow(i) - 1]);
  }
  range.store(min, max);
}

void mMinMax(const double* x, int count, double* min, double* max) {
  CbRows rows;
  rows.mUseAllRows(count);
  mMinMax(x, rows, min, max);
}

int mHadamardProduct(const std::vector<double>& a, const std::vector<double>& b,
                     std::vector<double>& out) {
  out.clear();
  const std::size_t n = std::min(a.size(), b.size());
  out.reserve(n);
  for (std::size_t i = 0; i < n; ++i) out.push_back(a[i] * b[i]);
  return static_cast<int>(n);
}

int mExponentiateVector(const std::vector<double>& x, std::vector<double>& out) {
  out.clear();
  out.reserve(x.size());
  for (double v : x) out.push_back(mExponential(v, true));
  return static_cast<int>(x.size());
}

int mLogVector(const std::vector<double>& x, std::vector<double>& out) {
  out.clear();
  out.reserve(x.size());
  for (double v : x) out.push_back(v > 0.0 ? mLog(v, true) : 0.0);
  return static_cast<int>(x.size());
}

std::vector<int> mGetINTGVectorIntersection(const std::vector<int>& a, const std::vector<int>& b) {
  std::vector<int> sorted(b);
  std::sort(sorted.begin(), sorted.end());
  std::vector<int> result;
  for (int v : a) {
    if (std::binary_search(sorted.begin(), sorted.end(), v)) result.push_back(v);
  }
  return result;
}

}  // namespace qel
