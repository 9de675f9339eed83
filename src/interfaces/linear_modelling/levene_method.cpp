// Levene's F from the rotated response of a Householder reduction: the rows
// within the rank carry the fitted part, the rows below it the residual.
// Both sums come from the same column, so any power-of-2 scaling applied by
// the reduction cancels in F.
#include "interfaces/linear_modelling/levene_method.h"

#include <qel/basic_types.h>
#include <qel/distributions.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <vector>

#include "interfaces/linear_modelling/utilities.h"

namespace qel {
namespace v1 {
namespace experimental {

int PerformLeveneMethod(double** design, unsigned N, unsigned groups, double const* y,
                        double* statistic, double* pValue) {
  const double nan = std::numeric_limits<double>::quiet_NaN();
  *statistic = nan;
  *pValue = nan;
  if (groups < 2 || N == 0) return qelOk;
  std::copy(y, y + N, design[groups]);
  // groups + 1 columns: the constant, groups - 1 indicators, the response.
  const unsigned degree = groups - 1;
  std::vector<double> coefficients(degree + 2);
  double r2 = nan;
  const int code = RunLynGrCurveFit(coefficients.data(), &r2, design, N, degree, 0.0, true);
  if (code == qelFailOutOfMemory) return code;
  if (code != qelOk) return qelOk;
  unsigned rank = 0;
  for (unsigned j = 0; j <= degree; ++j)
    if (!std::isnan(coefficients[j])) ++rank;
  if (rank < 2 || rank >= N) return qelOk;
  double const* rotated = design[groups];
  double ssr = 0.0, sse = 0.0;
  for (unsigned i = 1; i < rank; ++i) ssr += rotated[i] * rotated[i];
  for (unsigned i = rank; i < N; ++i) sse += rotated[i] * rotated[i];
  const double df1 = rank - 1.0, df2 = static_cast<double>(N) - rank;
  if (!(sse > 0.0) || !std::isfinite(ssr) || !std::isfinite(sse)) return qelOk;
  const double f = (ssr / df1) / (sse / df2);
  *statistic = f;
  *pValue = std::isinf(f) ? 0.0 : FPValue(f, df1, df2, kAlternativeGreater);
  return qelOk;
}

}  // namespace experimental
}  // namespace v1
}  // namespace qel
