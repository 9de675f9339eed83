// Inner side of the descriptive statistics: the compensated accumulator, the
// unexported members of the moment family, and the function objects that
// build a sort order.
#ifndef QEL_SRC_INTERFACES_BASIC_STATISTICS_UTILITIES_H
#define QEL_SRC_INTERFACES_BASIC_STATISTICS_UTILITIES_H

#include <qel/descriptive.h>

namespace qel {
namespace v1 {

// A running sum with Kahan's carry (Kahan, CACM 8 (1965) 40): the carry holds
// the low-order part lost by the last addition and is added back into the
// next term. The carry is not part of the value.
struct CompensatedSum {
  double sum = 0.0;
  double carry = 0.0;

  CompensatedSum() = default;
  explicit CompensatedSum(double start) : sum(start) {}

  void add(double term) {
    const double u = term + carry;
    const double s = sum + u;
    carry = u - (s - sum);
    sum = s;
  }
};

// Mean and standard deviation (square root of the n - 1 variance): NaN and
// NaN for n = 0, x[0] and 0 for n = 1.
void CalculateMeanAndStdDev(double const* x, unsigned int n, double* mean, double* stdDev);

// The centred cross sum of x and y, with the centred sums of squares; the
// sums are not divided. All three are 0 for n < 2.
double GetCenteredCrossProduct(double const* x, double const* y, unsigned int n, double* sumSqX,
                               double* sumSqY);

// out[0] = mean, out[1..3] = central sums of powers 2, 3, 4. For n = 0 and
// n = 1 out[0] = x[0] (which must exist) and the sums are 0.
void GetCenteredOrder4PowerSums(double const* x, unsigned int n, double* out);

// Number of events in an array of 0/1 indicators (a plain integer sum).
unsigned int GetEventCount(int const* x, unsigned int n);

// Yields 0, 1, 2, ... on successive calls: fills an index vector.
template <class T>
class Sequencer {
 public:
  explicit Sequencer(T start = T()) : next_(start) {}
  T operator()() { return next_++; }

 private:
  T next_;
};

// Orders indices by the values they point to.
template <class T>
class CompareLessThan {
 public:
  explicit CompareLessThan(T const* x) : x_(x) {}
  template <class I>
  bool operator()(I i, I j) const {
    return x_[i] < x_[j];
  }

 private:
  T const* x_;
};

}  // namespace v1
}  // namespace qel

#endif
