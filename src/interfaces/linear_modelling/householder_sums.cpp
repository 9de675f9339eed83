// Blocked passes of the Householder reduction (see householder_sums.h).
#include "interfaces/linear_modelling/householder_sums.h"

#include <algorithm>

namespace qel {
namespace v1 {
namespace experimental {

namespace {

constexpr std::size_t kBlock = 512;

// c[i] -= v[i] alpha, and returns the sum of w[i] times the new c[i]
// (w may be c itself).
double updateAndDot(double* c, double const* v, double alpha, double const* w, std::size_t length) {
  double s0 = 0.0, s1 = 0.0, s2 = 0.0, s3 = 0.0;
  std::size_t i = 0;
  for (; i + 4 <= length; i += 4) {
    c[i] -= v[i] * alpha;
    c[i + 1] -= v[i + 1] * alpha;
    c[i + 2] -= v[i + 2] * alpha;
    c[i + 3] -= v[i + 3] * alpha;
    s0 += w[i] * c[i];
    s1 += w[i + 1] * c[i + 1];
    s2 += w[i + 2] * c[i + 2];
    s3 += w[i + 3] * c[i + 3];
  }
  for (; i < length; ++i) {
    c[i] -= v[i] * alpha;
    s0 += w[i] * c[i];
  }
  return (s0 + s1) + (s2 + s3);
}

double blockDot(double const* a, double const* b, std::size_t length) {
  double s0 = 0.0, s1 = 0.0, s2 = 0.0, s3 = 0.0;
  std::size_t i = 0;
  for (; i + 4 <= length; i += 4) {
    s0 += a[i] * b[i];
    s1 += a[i + 1] * b[i + 1];
    s2 += a[i + 2] * b[i + 2];
    s3 += a[i + 3] * b[i + 3];
  }
  for (; i < length; ++i) s0 += a[i] * b[i];
  return (s0 + s1) + (s2 + s3);
}

}  // namespace

double dotProduct(double const* a, double const* b, std::size_t length) {
  double total = 0.0;
  for (std::size_t b0 = 0; b0 < length; b0 += kBlock)
    total += blockDot(a + b0, b + b0, std::min(kBlock, length - b0));
  return total;
}

double squaredNorm(double const* a, std::size_t length) {
  return dotProduct(a, a, length);
}

ColumnSums tailSums(double const* const* design, unsigned q, unsigned columns, std::size_t p,
                    std::size_t n) {
  ColumnSums sums;
  sums.dots.assign(columns, 0.0);
  if (p + 1 >= n) return sums;
  const std::size_t begin = p + 1, length = n - begin;
  double const* c = design[q] + begin;
  sums.tail = squaredNorm(c, length);
  for (unsigned k = q + 1; k < columns; ++k)
    sums.dots[k] = dotProduct(c, design[k] + begin, length);
  return sums;
}

ColumnSums initialSums(double const* const* design, unsigned columns, std::size_t n,
                       double* norm2) {
  ColumnSums sums;
  sums.dots.assign(columns, 0.0);
  std::fill(norm2, norm2 + columns, 0.0);
  for (std::size_t b0 = 0; b0 < n; b0 += kBlock) {
    const std::size_t length = std::min(kBlock, n - b0);
    const std::size_t skip = b0 == 0 ? 1 : 0;  // the tail starts below row 0
    double const* c0 = design[0] + b0;
    for (unsigned k = 0; k < columns; ++k) {
      double const* c = design[k] + b0;
      norm2[k] += blockDot(c, c, length);
      if (length > skip) {
        const double d = blockDot(c0 + skip, c + skip, length - skip);
        if (k == 0)
          sums.tail += d;
        else
          sums.dots[k] += d;
      }
    }
  }
  return sums;
}

ColumnSums applyReflection(double** design, unsigned q, unsigned columns, std::size_t p,
                           std::size_t n, double v0, double const* alpha) {
  ColumnSums next;
  next.dots.assign(columns, 0.0);
  double const* v = design[q];
  for (unsigned k = q + 1; k < columns; ++k) design[k][p] -= v0 * alpha[k];
  if (p + 1 >= n) return next;
  for (unsigned k = q + 1; k < columns; ++k) design[k][p + 1] -= v[p + 1] * alpha[k];
  const unsigned following = q + 1;
  double* w = design[following];
  for (std::size_t b0 = p + 2; b0 < n; b0 += kBlock) {
    const std::size_t length = std::min(kBlock, n - b0);
    next.tail += updateAndDot(w + b0, v + b0, alpha[following], w + b0, length);
    for (unsigned k = following + 1; k < columns; ++k)
      next.dots[k] += updateAndDot(design[k] + b0, v + b0, alpha[k], w + b0, length);
  }
  return next;
}

}  // namespace experimental
}  // namespace v1
}  // namespace qel
