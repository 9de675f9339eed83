// Comparison within a tolerance and integer tests on doubles.
//
// With eps = mGetEps(false) = 1e-12 and a scale f, two numbers compare equal
// when |a - b| <= abs(f) + eps * max(|a|, |b|), where abs(f) is 1e-30 for
// f = 0 and 1e-14 * f otherwise. The comparison is inclusive.
#ifndef QEL_SRC_UTILITIES_MATHUTILITIES_H
#define QEL_SRC_UTILITIES_MATHUTILITIES_H

#include <algorithm>
#include <cmath>
#include <vector>

#include "utilities/LYNBasicTypes.h"

namespace qel {

class CbRows;

// The smallest and largest non-missing value of the selected rows (numbered
// from 1) of x; both are the missing value when no row has a value. The
// vector form skips rows beyond the vector; the pointer forms trust the rows.
void mMinMax(const std::vector<double>& x, const CbRows& rows, double* min, double* max);
void mMinMax(const double* x, const CbRows& rows, double* min, double* max);
void mMinMax(const double* x, int count, double* min, double* max);

// Element-wise work; each empties out, appends to it and returns the count.
// The product runs over the shorter of a and b. The exponential is the
// checked one that throws on overflow; the logarithm of x <= 0 is 0.
int mHadamardProduct(const std::vector<double>& a, const std::vector<double>& b,
                     std::vector<double>& out);
int mExponentiateVector(const std::vector<double>& x, std::vector<double>& out);
int mLogVector(const std::vector<double>& x, std::vector<double>& out);

// The values of a (in a's order, repeats kept) that also occur in b.
std::vector<int> mGetINTGVectorIntersection(const std::vector<int>& a, const std::vector<int>& b);

// Inline: the distribution kernels compare within the fuzz on every call.
inline double mGetFuzzMax(double x) {
  return x * 0.01 * mGetEps(false);
}
inline int mCompareWithFuzz(double a, double b, double f) {
  const double absolutePart = f == 0.0 ? 1e-30 : mGetFuzzMax(f);
  const double tolerance = absolutePart + mGetEps(false) * std::max(std::fabs(a), std::fabs(b));
  if (std::fabs(a - b) <= tolerance) return 0;
  return a < b ? -1 : 1;
}
inline bool mEqualWithinFuzz(double a, double b, double f) {
  return mCompareWithFuzz(a, b, f) == 0;
}
// Only |a| scales the relative part: not symmetric in a and b.
bool mApproxEqual(double a, double b, double relative, double absolute);
bool mIsIntegerWithinFuzz(double x, double f);
bool mIsEven(double x, double f);
double mModulo(double a, double b);
// Halves go away from zero.
inline double mNearestInteger(double x) {
  return x >= 0.0 ? std::floor(x + 0.5) : std::ceil(x - 0.5);
}
// The magnitude's bits with the sign bit of the second argument.
double mTransferSign(double magnitude, double sign);

// Pointer forms used by the older numerical routines.
bool L_EQUAL_WITHIN_FUZZ(const double* a, const double* b, const double* f);
int L_COMPARE_WITH_FUZZ(const double* a, const double* b, const double* f);
double GET_NEAREST_INTEGER(const double* x);
double GET_FLOOR(const double* x);
double GET_CEILING(const double* x);
bool LEQUAL(const double* a, const double* b, const double* relative, const double* absolute);

// Rounding. Powers of ten are applied in chunks of at most 1e308, so that
// no intermediate power overflows.
double mScaleByPowerOfTen(double x, int p);
// Rounds to a number of decimal places, halves away from zero. The missing
// value and 0 come back unchanged; a result beyond the double range is the
// missing value.
double mRound(double x, int places);
double mRoundToSigDigits(double x, int digits);
// Nearest multiple of m, with the sign of x; x itself when x or m is 0.
double mRoundToMultiple(double x, double m);

// Combinatorics on the logarithm of the gamma function.
double mLogNChooseK(int n, int k);
int mNChooseK(int n, int k);
int mNFactorial(int n);
double mPermutations(double n, double k);
double mCombinations(double n, double k);
int N_CHOOSE_K(const unsigned* n, const unsigned* k);

// A term of an alternating series for mAlternateSeriesSum. operator()(k) is
// the k-th term; the transformation averages consecutive terms, so the term
// carries its alternating sign.
class CmAlternateSeriesTerm {
 public:
  CmAlternateSeriesTerm();
  virtual ~CmAlternateSeriesTerm();
  virtual double operator()(int k) = 0;
  virtual double mGetTolerance() const;
  virtual void mEulerVan(std::vector<double>& work, int k, double* sum,
                         CmAlternateSeriesTerm& term);

 private:
  double mTolerance;
};

// Sum of the series from index start by the Euler-van Wijngaarden
// transformation, until two partial sums agree to the term's tolerance.
double mAlternateSeriesSum(int start, CmAlternateSeriesTerm& term);

// The k-subsets of {0, ..., n-1} in lexicographic order.
class CmSubsetsOfNChooseK {
 public:
  CmSubsetsOfNChooseK();
  CmSubsetsOfNChooseK(const CmSubsetsOfNChooseK&) = default;
  CmSubsetsOfNChooseK& operator=(const CmSubsetsOfNChooseK&) = default;
  virtual ~CmSubsetsOfNChooseK();
  // Starts the enumeration; returns the number of subsets.
  int mInitialize(int n, int k);
  // Copies the next subset to out; leaves out alone once all were delivered.
  void mNextSubset(std::vector<int>& out);

 private:
  std::vector<int> mSubset;
  int mN;
  int mK;
  int mCount;
  int mIndex;
};

// The k-multisets of {0, ..., n-1} as non-decreasing sequences: first the n
// constant ones, then the others in lexicographic order.
class CmSubsetsOfNChooseKWithReplacement {
 public:
  CmSubsetsOfNChooseKWithReplacement();
  CmSubsetsOfNChooseKWithReplacement(const CmSubsetsOfNChooseKWithReplacement&) = default;
  CmSubsetsOfNChooseKWithReplacement& operator=(const CmSubsetsOfNChooseKWithReplacement&) =
      default;
  virtual ~CmSubsetsOfNChooseKWithReplacement();
  int mInitialize(int n, int k);
  void mNextSubset(std::vector<int>& out);

 private:
  // Advances mSubset to the next non-decreasing sequence; false at the end.
  bool mAdvance();

  std::vector<int> mSubset;
  int mN;
  int mK;
  int mCount;
  int mIndex;
};

// Gaussian quadrature by the method of Golub and Welsch (Math. Comp. 23
// (1969) 221): the nodes are the eigenvalues of the symmetric tridiagonal
// Jacobi matrix of the orthogonal polynomials, the weights mu0 times the
// squared first components of its normalised eigenvectors. False when the
// eigensystem fails (or alpha <= -1 for Laguerre); the vectors are then
// empty.
//
// Legendre (weight 1 on [-1, 1], mu0 = 2): the n/2 positive nodes in
// descending order with their weights, each pair averaged with its mirror
// image; an odd n leaves out its middle node 0.
bool mGaussianQuadratureWeights(unsigned n, std::vector<double>& nodes,
                                std::vector<double>& weights);
// Hermite (weight exp(-x^2), mu0 = sqrt(pi)): all n nodes ascending, or with
// half the n/2 positive nodes descending.
bool mGaussHermiteQuadratureWeights(unsigned n, std::vector<double>& nodes,
                                    std::vector<double>& weights, bool half);
// Generalised Laguerre (weight x^alpha exp(-x) on (0, inf), mu0 =
// Gamma(alpha + 1)): n nodes ascending.
bool mGaussLaguerreQuadratureWeights(unsigned n, std::vector<double>& nodes,
                                     std::vector<double>& weights, double alpha);

// Ranks of the selected (1-based) rows of values. out is resized to the
// data and filled with the missing value, then each ranked row gets its rank
// at row - 1; outRows gets the row numbers in ascending order of value
// (stable). With averageTies a run of equal values at positions i .. j - 1
// (from 0) shares the rank (i + j + 1)/2, otherwise every row is its own run
// (ties by row order). Descending ranks are count + 1 minus the ascending
// ones. The missing value is ranked as the number it is; NaN cells and rows
// outside the data are left out and keep the missing value.
void mComputeRanks(const std::vector<double>& values, const CbRows& rows, std::vector<double>& out,
                   CbRows& outRows, bool averageTies, bool ascending);
void mComputeRanks(const std::vector<double>& values, std::vector<double>& out, CbRows& outRows,
                   bool averageTies, bool ascending);
void mComputeRanks(const std::vector<double>& values, const CbRows& rows, std::vector<double>& out,
                   bool averageTies, bool ascending);
void mComputeRanks(const std::vector<double>& values, std::vector<double>& out, bool averageTies,
                   bool ascending);
// Re-ranks after mComputeRanks so that missing values count for nothing: in
// each group of equal rank (walked from the smallest rank), the m rows that
// are not missing get 0.5 (2c + m + 1), c the non-missing rows of the groups
// before; missing rows get the missing value.
void mAdjustRanksForMisingValues(const std::vector<double>& values, const CbRows& sortedRows,
                                 std::vector<double>& ranks);

class CmRealFunction;
// Integral of f over [a, b]: h times the sum over the stored node-weight
// pairs of w (f(c + h x) + f(c - h x)), c = (a + b)/2, h = (b - a)/2. For
// n = 16 the classic 16-point table, without eigenvalues; otherwise the
// pairs of mGaussianQuadratureWeights (the missing value if that fails).
double mGaussianIntegration(double a, double b, CmRealFunction& f, unsigned n);
double mGaussianIntegration(double a, double b, std::vector<double> const& nodes,
                            std::vector<double> const& weights, CmRealFunction& f);
// Plain weighted sums sum w f(x) of the Hermite and Laguerre rules (the rule
// of n points, or caller-supplied tables).
double mGaussHermiteIntegration(CmRealFunction& f, unsigned n);
double mGaussHermiteIntegration(std::vector<double> const& nodes,
                                std::vector<double> const& weights, CmRealFunction& f);
double mGaussLaguerreIntegration(CmRealFunction& f, unsigned n, double alpha);
double mGaussLaguerreIntegration(std::vector<double> const& nodes,
                                 std::vector<double> const& weights, CmRealFunction& f);

// Sign confidence levels with nonlinear interpolation (Hettmansperger and
// Sheather, 1986). levels gets the achieved confidences {a, a'} of the
// order-statistic intervals of depth d and d + 1 around the confidence
// (binomial law, its continuity-corrected normal form above n = 50), lambda
// the interpolation weight; kind 1 when even the widest interval falls
// short ({a}, d 1, lambda 0), 2 when the walk reached d = n/2, else 0.
void mSint(int n, double confidence, std::vector<double>& levels, int* d, int* kind,
           double* lambda);
// Pointer form: levels receives at most two values.
void SINT(const int* n, const double* confidence, double* levels, int* d, int* kind,
          double* lambda);

}  // namespace qel

#endif
