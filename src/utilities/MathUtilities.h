// Comparison within a tolerance and integer tests on doubles.
//
// With eps = mGetEps(false) = 1e-12 and a scale f, two numbers compare equal
// when |a - b| <= abs(f) + eps * max(|a|, |b|), where abs(f) is 1e-30 for
// f = 0 and 1e-14 * f otherwise. The comparison is inclusive.
#ifndef QEL_SRC_UTILITIES_MATHUTILITIES_H
#define QEL_SRC_UTILITIES_MATHUTILITIES_H

#include <vector>

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

double mGetFuzzMax(double x);
int mCompareWithFuzz(double a, double b, double f);
bool mEqualWithinFuzz(double a, double b, double f);
// Only |a| scales the relative part: not symmetric in a and b.
bool mApproxEqual(double a, double b, double relative, double absolute);
bool mIsIntegerWithinFuzz(double x, double f);
bool mIsEven(double x, double f);
double mModulo(double a, double b);
// Halves go away from zero.
double mNearestInteger(double x);
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

}  // namespace qel

#endif
