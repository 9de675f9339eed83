// The range of k independent standard normal variables (the normal range
// with known sigma): distribution, quantile, critical value and P-value.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_NORMAL_RANGE_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_NORMAL_RANGE_H

#include "utilities/RootsAndOptima.h"

namespace qel {

// P(R <= r) or P(R > r), each tail computed in its own right: r <= 0 gives
// lower 0 and upper 1; k < 2 or NaN r the missing value.
double mNormalRangeCdf(double r, int k, bool upperTail);
// The r with P(R <= r) = p, to full precision (the missing value for p
// outside [0, 1) or k < 2; 0 for p = 0).
double mNormalRangeInvCdf(double p, int k);
// The r with P(R > r) = alpha.
double mNormalRangeCritValue(double alpha, int k);
// P(R >= r).
double mNormalRangePValue(double r, int k);

// The range distribution minus a target, for root finders.
class CmNormalRangeCdf : public CmRealFunction {
 public:
  CmNormalRangeCdf(int k, double target) : mK(k), mTarget(target) {}
  double operator()(double r) override { return mNormalRangeCdf(r, mK, false) - mTarget; }

 private:
  int mK;
  double mTarget;
};

// The integrand of P(R <= r): k phi(x) (Phi(x + r) - Phi(x))^(k - 1).
class CmNormalRangePdfLike : public CmRealFunction {
 public:
  CmNormalRangePdfLike(int k, double r) : mK(k), mR(r) {}
  double operator()(double x) override;

 private:
  int mK;
  double mR;
};

}  // namespace qel

#endif
