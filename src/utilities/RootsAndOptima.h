// One-dimensional searches: a real function object that carries its own
// tolerances, a bracket finder, an Illinois regula falsi root finder and a
// golden-section minimiser. Every inverse without a closed form, every
// P-value equation and every sample-size solver of the library is a subclass
// of CmRealFunction handed to one of these routines.
#ifndef QEL_SRC_UTILITIES_ROOTSANDOPTIMA_H
#define QEL_SRC_UTILITIES_ROOTSANDOPTIMA_H

namespace qel {

// A function of one real (or integer) argument. Subclasses subtract the
// target in operator() so that the sought value is a root, and answer the
// missing value where the function has no value. The tolerances live here so
// that the search routines need no tolerance arguments; a subclass or its
// user may change them after construction.
class CmRealFunction {
 public:
  CmRealFunction();
  CmRealFunction(const CmRealFunction& other) = default;
  virtual CmRealFunction& operator=(const CmRealFunction& other);
  virtual ~CmRealFunction();

  virtual double operator()(double x) = 0;

  virtual double mGetAbsoluteToleranceForX() const;
  virtual double mGetRelativeToleranceForX() const;
  virtual double mGetAbsoluteToleranceForF() const;
  virtual double mGetRelativeToleranceForF() const;

  // |x1 - x2| below 2 for an integer argument, below the absolute tolerance
  // otherwise, or below the relative tolerance times max(|x1|, |x2|).
  virtual bool mIsConvergedForX(double x1, double x2) const;
  // |f| within the absolute tolerance, or within |target| times the relative
  // tolerance. Reads the fields, not the accessors.
  virtual bool mIsConvergedForF(double f) const;

  // The argument is an integer: searches move on whole numbers.
  bool mIntegerValued;
  // The value sought; it also scales the relative test on f.
  double mTarget;
  double mAbsoluteToleranceForX;
  double mRelativeToleranceForX;
  double mAbsoluteToleranceForF;
  double mRelativeToleranceForF;
};

// The root (sqrt(b*b - 4ac) - b) / 2a of a x^2 + b x + c, or the missing
// value when the discriminant is negative (or NaN). The other root is not
// computed.
double mRootOfQuadratic(double a, double b, double c);

// Narrows or widens [*x1, *x2] within [lower, upper] until f changes sign
// on it (or is already zero at an end). Returns 0 or qelFailRootNoBracket;
// on return after an expansion the bracket is ascending.
int mBracketFinder(double* x1, double* x2, CmRealFunction& f, double lower, double upper);

// The root of f between x1 and x2 by the Illinois variant of regula falsi.
// *status gets 0, qelFailRootNoValue (f has no value at an end) or
// qelFailRootNoBracket (no sign change); on failure the missing value is
// returned.
double mRootFinder(double x1, double x2, CmRealFunction& f, int* status);

// The minimum of f between x1 and x2 by golden-section search; with
// integerResult the nearest integer local minimum at or above the search
// result is returned instead.
double mGoldenSection(double x1, double x2, CmRealFunction& f, bool integerResult);

}  // namespace qel

#endif
