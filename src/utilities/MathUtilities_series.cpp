// Sums of alternating series by the Euler-van Wijngaarden transformation
// (see Press et al., Numerical Recipes, section 5.1): the partial sums are
// replaced by repeated averages of consecutive terms, which converge much
// faster for slowly decreasing alternating terms.
#include <cmath>

#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"

namespace qel {

CmAlternateSeriesTerm::CmAlternateSeriesTerm() : mTolerance(mGetEps(false)) {}
CmAlternateSeriesTerm::~CmAlternateSeriesTerm() {}

double CmAlternateSeriesTerm::mGetTolerance() const { return mTolerance; }

void CmAlternateSeriesTerm::mEulerVan(std::vector<double>& work, int k, double* sum,
                                      CmAlternateSeriesTerm& term) {
  const std::size_t m = work.size() - 1;
  const double t = work[0];
  double u = work[1];
  work[0] = term(k);
  work[1] = (work[0] + t) / 2.0;
  for (std::size_t j = 2; j <= m; ++j) {
    const double v = work[j];
    work[j] = (work[j - 1] + u) / 2.0;
    u = v;
  }
  // While the highest difference still shrinks, the table grows by one.
  if (std::fabs(work[m - 1]) >= std::fabs(work[m])) {
    *sum += work[m] / 2.0;
    work.push_back(0.0);
  } else {
    *sum += work[m];
  }
}

double mAlternateSeriesSum(int start, CmAlternateSeriesTerm& term) {
  const double tol = term.mGetTolerance();
  std::vector<double> work;
  work.reserve(50);
  work.assign(2, 0.0);
  work[0] = term(start);
  double sum = work[0] / 2.0;
  double previous = tol;
  // No iteration cap: the caller's series must converge.
  for (int k = start + 1; std::fabs(previous - sum) > tol * std::fabs(sum); ++k) {
    previous = sum;
    term.mEulerVan(work, k, &sum, term);
  }
  return sum;
}

}  // namespace qel
