// Householder least squares on augmented designs held by columns, and the
// designs themselves. References: G. H. Golub and C. F. Van Loan, Matrix
// Computations, 4th ed. (2013), algorithm 5.1.1 (the Householder vector
// with Parlett's choice of sign, which maps a column onto +||x|| e_1 without
// cancellation) and section 5.3 (least squares by QR); C. L. Lawson and
// R. J. Hanson, Solving Least Squares Problems (1974), chapter 14 (columns
// dropped when their reduced norm is negligible).
#include "interfaces/linear_modelling/utilities.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <limits>
#include <new>
#include <vector>

#include "interfaces/linear_modelling/householder_sums.h"

namespace qel {
namespace v1 {
namespace experimental {

namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr double kDefaultTolerance = 1e-12;

// Sums of squares within [2^-900, 2^900] leave room for every square and
// product of the reduction; outside it the columns are scaled first.
const double kSmallSum = std::ldexp(1.0, -900);
const double kLargeSum = std::ldexp(1.0, 900);

// The reflection of a column with first element *head and sum of squares s
// (> 0) of the rest: *head becomes the first element of the Householder
// vector, *beta its factor; returns r = ||column||.
double reflectHeadAndTail(double* head, double s, double* beta) {
  const double a = *head;
  const double r = std::sqrt(a * a + s);
  const double v0 = a > 0.0 ? -s / (a + r) : a - r;
  *head = v0;
  *beta = 2.0 / (v0 * v0 + s);
  return r;
}

double** allocateColumns(unsigned columns, std::size_t rows, int* status) {
  double** design = nullptr;
  unsigned made = 0;
  try {
    design = new double*[columns];
    for (; made < columns; ++made) design[made] = new double[rows];
    *status = qelOk;
    return design;
  } catch (const std::bad_alloc&) {
    if (design) {
      for (unsigned k = 0; k < made; ++k) delete[] design[k];
      delete[] design;
    }
    *status = qelFailOutOfMemory;
    return nullptr;
  }
}

bool allFinite(double const* const* design, unsigned columns, std::size_t n) {
  for (unsigned k = 0; k < columns; ++k)
    for (std::size_t i = 0; i < n; ++i)
      if (!std::isfinite(design[k][i])) return false;
  return true;
}

// Scales each column by a power of 2 (exactly) so that its largest element
// lies in [0.5, 1); exponents[k] receives the binary exponent taken out.
void scaleColumns(double** design, unsigned columns, std::size_t n, int* exponents) {
  for (unsigned k = 0; k < columns; ++k) {
    double largest = 0.0;
    for (std::size_t i = 0; i < n; ++i) largest = std::max(largest, std::fabs(design[k][i]));
    exponents[k] = 0;
    if (largest == 0.0) continue;
    std::frexp(largest, &exponents[k]);
    const double factor = std::ldexp(1.0, -exponents[k]);
    for (std::size_t i = 0; i < n; ++i) design[k][i] *= factor;
  }
}

// A sum of 0 may hide squares that underflowed: that column is scaled too
// (a column of zeros is left as it is).
bool sumsInRange(const std::vector<double>& norm2) {
  for (double s : norm2)
    if (!(s >= kSmallSum && s <= kLargeSum)) return false;
  return true;
}

// The outcome of the reduction of a design.
struct Reduction {
  std::vector<unsigned> passed;  // the terms kept, in order
  std::vector<double> packed;    // their R, packed by columns
  double residualSquares = 0.0;  // RSS
};

// Householder reduction of the terms 0..columns-2 of design, each applied
// to the columns on its right and to the response. A term whose reduced
// norm |R_jj| is at most tolerance * sqrt(norm2[j]) is left out; the next
// term then takes its pivot row.
Reduction reduce(double** design, unsigned columns, std::size_t n, double tolerance,
                 const std::vector<double>& norm2, ColumnSums sums) {
  const unsigned terms = columns - 1;
  Reduction out;
  std::vector<double> alpha(columns, 0.0);
  bool haveSums = true;  // sums hold the tail of the current column
  std::size_t row = 0;   // pivot row: the number of terms kept so far
  for (unsigned q = 0; q < terms; ++q) {
    if (!haveSums) sums = tailSums(design, q, columns, row, n);
    if (row >= n) {  // no row left: the term fails
      haveSums = false;
      continue;
    }
    double v0 = design[q][row];
    double beta = 0.0;
    const double diagonal =
        sums.tail > 0.0 ? reflectHeadAndTail(&v0, sums.tail, &beta) : design[q][row];
    if (!(std::fabs(diagonal) > tolerance * std::sqrt(norm2[q]))) {
      haveSums = false;
      continue;
    }
    out.passed.push_back(q);
    out.packed.insert(out.packed.end(), design[q], design[q] + row);
    out.packed.push_back(diagonal);
    if (beta != 0.0) {
      for (unsigned k = q + 1; k < columns; ++k)
        alpha[k] = beta * (sums.dots[k] + v0 * design[k][row]);
      sums = applyReflection(design, q, columns, row, n, v0, alpha.data());
      haveSums = true;
    } else {
      haveSums = false;
    }
    ++row;
  }
  if (!haveSums) sums = tailSums(design, terms, columns, row, n);
  const double head = row < n ? design[terms][row] : 0.0;
  out.residualSquares = row < n ? head * head + sums.tail : 0.0;
  return out;
}

int fitDesign(double* coefficients, double* fitStatistic, double** design, unsigned n,
              unsigned degree, double tolerance, bool intercept) {
  const unsigned columns = CurveFitDesignColumns(degree, intercept);
  const unsigned terms = columns - 1;
  if (!(tolerance > 0.0)) tolerance = kDefaultTolerance;
  if (terms == 0 || n == 0) return qelFailSingular;

  std::vector<double> norm2(columns);
  std::vector<int> exponents(columns, 0);
  ColumnSums sums = initialSums(design, columns, n, norm2.data());
  for (double s : norm2)
    if (!std::isfinite(s) && !allFinite(design, columns, n)) return qelFailSingular;
  if (!sumsInRange(norm2)) {
    scaleColumns(design, columns, n, exponents.data());
    sums = initialSums(design, columns, n, norm2.data());
  }

  const Reduction reduction = reduce(design, columns, n, tolerance, norm2, sums);
  const std::size_t rank = reduction.passed.size();
  if (rank == 0) return qelFailSingular;

  const double* response = design[terms];
  std::vector<double> solution(rank);
  SolveUpperTriangularSystem(solution.data(), reduction.packed.data(), static_cast<unsigned>(rank),
                             response);
  const unsigned first = intercept ? 0u : 1u;  // the coefficient of term 0
  for (unsigned j = 0; j < degree + 1; ++j) coefficients[j] = kNaN;
  if (!intercept) coefficients[0] = 0.0;
  const int ey = exponents[terms];
  for (std::size_t i = 0; i < rank; ++i) {
    const unsigned q = reduction.passed[i];
    coefficients[first + q] = std::ldexp(solution[i], ey - exponents[q]);
  }

  // The rotated response: rows below the intercept's pivot and within the
  // rank carry the explained sum of squares about the mean.
  const std::size_t start = intercept && reduction.passed[0] == 0 ? 1 : 0;
  double explained = 0.0;
  for (std::size_t i = start; i < rank; ++i) explained += response[i] * response[i];
  const double rss = reduction.residualSquares;
  const double total = explained + rss;
  *fitStatistic = total > 0.0 ? explained / total : kNaN;
  coefficients[degree + 1] =
      rank < n ? std::ldexp(std::sqrt(rss / static_cast<double>(n - rank)), ey) : kNaN;
  return qelOk;
}

}  // namespace

double GenerateHouseholderVector(double* v, unsigned length, double* beta) {
  *beta = 0.0;
  if (length <= 1) return v[0];
  double s = squaredNorm(v + 1, length - 1);
  const double a = std::fabs(v[0]);
  if (!(s >= kSmallSum && s <= kLargeSum && a <= std::sqrt(kLargeSum))) {
    // Extreme magnitudes: scale v by a power of 2 (the reflection of the
    // scaled vector is the same), then scale the norm back.
    double tail = 0.0;
    for (unsigned i = 1; i < length; ++i) tail = std::max(tail, std::fabs(v[i]));
    if (s == 0.0 && tail == 0.0) return v[0];  // the identity
    const double largest = std::max(tail, a);
    if (std::isnan(s) || std::isnan(a) || std::isinf(largest)) {
      *beta = kNaN;
      return kNaN;
    }
    int e = 0;
    std::frexp(largest, &e);
    const double factor = std::ldexp(1.0, -e);
    for (unsigned i = 0; i < length; ++i) v[i] *= factor;
    return std::ldexp(reflectHeadAndTail(v, squaredNorm(v + 1, length - 1), beta), e);
  }
  return reflectHeadAndTail(v, s, beta);
}

void HouseholderTransform(double* column, double const* v, double beta, unsigned length) {
  const double t = beta * dotProduct(v, column, length);
  for (unsigned i = 0; i < length; ++i) column[i] -= v[i] * t;
}

void SolveUpperTriangularSystem(double* solution, double const* packedUpper, unsigned order,
                                double const* rightSide) {
  for (unsigned i = order; i-- > 0;) {
    double sum = rightSide[i];
    for (unsigned j = i + 1; j < order; ++j)
      sum -= packedUpper[static_cast<std::size_t>(j) * (j + 1) / 2 + i] * solution[j];
    solution[i] = sum / packedUpper[static_cast<std::size_t>(i) * (i + 1) / 2 + i];
  }
}

void SetToNonAnswerResult(double* coefficients, double* fitStatistic, unsigned degree) {
  for (unsigned j = 0; j < degree + 2; ++j) coefficients[j] = kNaN;
  *fitStatistic = kNaN;
}

double** MakeNAryAugmentedDesignMatrix(double const* x, double const* y, unsigned n,
                                       unsigned degree, int* status, bool intercept) {
  const unsigned columns = CurveFitDesignColumns(degree, intercept);
  double** design = allocateColumns(columns, n, status);
  if (!design) return nullptr;
  double* const* powers = design + (intercept ? 1 : 0);  // powers[k - 1] holds x^k
  const long rows = static_cast<long>(n);
  // A region pays for itself from some thousands of rows on.
#pragma omp parallel if (rows >= 8192) default(none) \
    shared(x, y, n, degree, intercept, design, powers, columns, rows)
  {
#pragma omp single nowait
    {
      if (intercept) std::fill(design[0], design[0] + n, 1.0);
      if (degree >= 1) std::copy(x, x + n, powers[0]);
      std::copy(y, y + n, design[columns - 1]);
    }
    if (degree >= 2) {
#pragma omp for schedule(static)
      for (long i = 0; i < rows; ++i) {
        const double xi = x[i];
        double p = xi;
        for (unsigned k = 2; k <= degree; ++k) {
          p *= xi;
          powers[k - 1][i] = p;
        }
      }
    }
  }
  return design;
}

void DeleteAugmentedDesignMatrix(double*** design, unsigned columns) {
  if (!design || !*design) return;
  for (unsigned k = 0; k < columns; ++k) delete[](*design)[k];
  delete[] * design;
  *design = nullptr;
}

double** MakeDesignMatrix(unsigned const* groupSizes, unsigned groups, int* status) {
  std::size_t rows = 0;
  for (unsigned g = 0; g < groups; ++g) rows += groupSizes[g];
  double** design = allocateColumns(groups + 1, rows, status);
  if (!design) return nullptr;
  std::fill(design[groups], design[groups] + rows, 0.0);
  if (groups == 0) return design;
  std::fill(design[0], design[0] + rows, 1.0);
  std::size_t begin = groupSizes[0];
  for (unsigned g = 1; g < groups; ++g) {
    std::fill(design[g], design[g] + rows, 0.0);
    std::fill(design[g] + begin, design[g] + begin + groupSizes[g], 1.0);
    begin += groupSizes[g];
  }
  return design;
}

int RunLynGrCurveFit(double* coefficients, double* fitStatistic, double** design, unsigned n,
                     unsigned degree, double tolerance, bool intercept) {
  int code = qelFailOutOfMemory;
  try {
    code = fitDesign(coefficients, fitStatistic, design, n, degree, tolerance, intercept);
  } catch (const std::bad_alloc&) {
  }
  if (code != qelOk) SetToNonAnswerResult(coefficients, fitStatistic, degree);
  return code;
}

}  // namespace experimental

int RunLynGrCurveFit(double* coefficients, double* fitStatistic, double const* x, double const* y,
                     unsigned n, unsigned degree, double tolerance, bool intercept) {
  int status = qelOk;
  double** design =
      experimental::MakeNAryAugmentedDesignMatrix(x, y, n, degree, &status, intercept);
  if (!design) {
    experimental::SetToNonAnswerResult(coefficients, fitStatistic, degree);
    return status;
  }
  const int code = experimental::RunLynGrCurveFit(coefficients, fitStatistic, design, n, degree,
                                                  tolerance, intercept);
  experimental::DeleteAugmentedDesignMatrix(&design,
                                            experimental::CurveFitDesignColumns(degree, intercept));
  return code;
}

}  // namespace v1
}  // namespace qel
