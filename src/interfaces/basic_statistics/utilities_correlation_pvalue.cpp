// P-value of a correlation coefficient by the t test on n - 2 degrees of
// freedom.
#include <qel/descriptive.h>

#include <cmath>

#include "interfaces/math/random_distributions_v0.h"
#include "utilities/LYNBasicTypes.h"

namespace qel {
namespace v0 {

double GetLynCorrelationPValue(double r, unsigned int n) {
  if (n <= 2) return mQuietNaN();
  const double nu = n - 2.0;
  // |r| = 1 gives an infinite t, whose P-value is 0.
  const double t = r * std::sqrt(nu / (1.0 - r * r));
  return TPValue(t, nu, kAlternativeNotEqual);
}

}  // namespace v0
}  // namespace qel
