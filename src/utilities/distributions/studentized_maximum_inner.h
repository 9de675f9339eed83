// The conditional laws (s = 1) of the studentized maximum, maximum modulus
// and range, shared by their P-values and critical values.
#ifndef QEL_SRC_UTILITIES_DISTRIBUTIONS_STUDENTIZED_MAXIMUM_INNER_H
#define QEL_SRC_UTILITIES_DISTRIBUTIONS_STUDENTIZED_MAXIMUM_INNER_H

#include <vector>

#include "utilities/distributions/studentized_maximum.h"

namespace qel {

class TailLanes;

// P(max Y_i > w) or P(max |Y_i| > w) for consolidated lambdas.
class CmMaximumInner : public CbStudentizedInner {
 public:
  CmMaximumInner(const std::vector<double>& distinct, const std::vector<unsigned>& counts,
                 bool modulus);
  double upperTail(double w) const override;
  double upperBound(double w) const override;
  double studentizedLowerBound(double x, double df) const override;
  // The total number of variables k.
  double size() const { return mK; }

 private:
  struct Factor {
    // lambda (its modulus for the maximum modulus), c = sqrt(1 - d^2), 1/c,
    // count
    double d, c, invC, m;
  };
  // prod_j F_j(z)^m_j at the point z of the lanes as e^sum rest: returns
  // sum (1 when some F_j is 0) and sets rest; normal tails beyond cut are
  // taken as 0.
  double logProduct(double cut, const TailLanes& lanes, double* rest) const;
  // int phi(z) (1 - prod_j F_j(z)^m_j) dz over the lambdas other than 0.
  double zIntegral(double w) const;

  std::vector<Factor> mFactors;
  double mZeros = 0.0;  // how many lambdas are 0
  double mK = 0.0;
  bool mModulus;
};

// P(T > x s) for the maximum or modulus: a trapezoidal sum over log s for
// df >= 4, mGLV otherwise.
double mMaximumTail(const CmMaximumInner& inner, double x, double df);

// P(R > w), R the range of k standard normal variables.
class CmRangeInner : public CbStudentizedInner {
 public:
  explicit CmRangeInner(int k) : mK(k) {}
  double upperTail(double w) const override;
  double upperBound(double w) const override;
  double studentizedLowerBound(double x, double df) const override;

 private:
  int mK;
};

}  // namespace qel

#endif
