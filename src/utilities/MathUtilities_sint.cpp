// Sign confidence levels with nonlinear interpolation: the achieved
// confidences of the two order-statistic intervals around a requested one,
// and the weight of Hettmansperger and Sheather (Statist. Probab. Lett. 4
// (1986) 75) that interpolates between them.
#include <cmath>
#include <vector>

#include "utilities/MathUtilities.h"
#include "utilities/distributions/kernels.h"

namespace qel {
namespace {

// Confidence of the interval (x(d+1), x(n-d)) : 1 - 2 P(X <= d), X ~
// Bin(n, 1/2); from the continuity-corrected normal law above n = 50.
double normalLevel(int n, int d) {
  const double z = (d + 0.5 - 0.5 * n) / std::sqrt(0.25 * n);
  return 1.0 - 2.0 * mNormalCdf(z, 0.0, 1.0, false);
}

}  // namespace

void mSint(int n, double confidence, std::vector<double>& levels, int* d, int* kind,
           double* lambda) {
  double a = n >= 1 ? 1.0 - std::pow(0.5, n - 1) : 0.0;
  *kind = 0;
  if (n < 2 || confidence >= a) {
    *kind = 1;
    levels.assign(1, a);
    *d = 1;
    *lambda = 0.0;
    return;
  }
  const int last = n / 2;
  double next = a;
  int depth = 1;
  for (;; ++depth) {
    next = n > 50 ? normalLevel(n, depth) : a - 2.0 * mBinomialPdf(depth, n, 0.5);
    if (next <= confidence && confidence <= a) break;
    if (depth >= last) break;
    a = next;
  }
  *d = depth;
  levels.assign({a, next});
  const double r = a > next ? (a - confidence) / (a - next) : 0.0;
  *lambda = (n - depth) * r / (depth + (n - 2.0 * depth) * r);
  if (depth >= last) *kind = 2;
}

void SINT(const int* n, const double* confidence, double* levels, int* d, int* kind,
          double* lambda) {
  std::vector<double> v;
  mSint(*n, *confidence, v, d, kind, lambda);
  for (std::size_t i = 0; i < v.size() && i < 2; ++i) levels[i] = v[i];
}

}  // namespace qel
