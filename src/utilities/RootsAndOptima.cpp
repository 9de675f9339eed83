// Root finding and minimisation on CmRealFunction.
//
// The root finder is the Illinois variant of regula falsi (Dowell and
// Jarratt, BIT 11 (1971) 168-174): a false-position step, and whenever an end
// is retained its stored function value is halved so that the secant cannot
// stall on one side. The minimiser is Kiefer's golden-section search. Neither
// routine has an iteration cap: termination rests on the convergence tests
// of the function object, which the callers tune.
#include "utilities/RootsAndOptima.h"

#include <qel/basic_types.h>

#include <algorithm>
#include <cmath>

#include "utilities/LYNBasicTypes.h"
#include "utilities/CheckedFunctions.h"

namespace qel {

namespace {

// Golden-section fractions: 1/phi and 1 - 1/phi.
constexpr double kGoldenLarge = 0.6180339887498949;
constexpr double kGoldenSmall = 0.3819660112501052;

bool isAbove(double f) {
  return f > 0.0;
}

// Strictly opposite signs; a zero or NaN is on neither side.
bool strictlyOpposite(double a, double b) {
  return (a > 0.0 && b < 0.0) || (a < 0.0 && b > 0.0);
}

// The integer rule of the root finder: the smallest integer above floor(x1)
// at which f has reached the side of f2 (or zero). The walk never passes the
// upper end of the final bracket, which a monotone function reaches anyway;
// this bounds the walk for a function that never turns.
double integerRoot(CmRealFunction& f, double x1, double f1, double x2, double f2) {
  double n = std::floor(x1);
  if (!strictlyOpposite(f1, f2)) return n;
  const double last = std::ceil(std::max(x1, x2));
  do {
    n += 1.0;
  } while (n < last && strictlyOpposite(f(n), f2));
  return n;
}

}  // namespace

CmRealFunction::CmRealFunction()
    : mIntegerValued(false),
      mTarget(0.0),
      mAbsoluteToleranceForX(mGetNearlyZero()),
      mRelativeToleranceForX(mGetEps(false)),
      mAbsoluteToleranceForF(mGetNearlyZero()),
      mRelativeToleranceForF(mGetEps(false)) {}

CmRealFunction& CmRealFunction::operator=(const CmRealFunction& other) {
  if (this != &other) {
    mIntegerValued = other.mIntegerValued;
    mTarget = other.mTarget;
    mAbsoluteToleranceForX = other.mAbsoluteToleranceForX;
    mRelativeToleranceForX = other.mRelativeToleranceForX;
    mAbsoluteToleranceForF = other.mAbsoluteToleranceForF;
    mRelativeToleranceForF = other.mRelativeToleranceForF;
  }
  return *this;
}

CmRealFunction::~CmRealFunction() = default;

double CmRealFunction::mGetAbsoluteToleranceForX() const {
  return mAbsoluteToleranceForX;
}
double CmRealFunction::mGetRelativeToleranceForX() const {
  return mRelativeToleranceForX;
}
double CmRealFunction::mGetAbsoluteToleranceForF() const {
  return mAbsoluteToleranceForF;
}
double CmRealFunction::mGetRelativeToleranceForF() const {
  return mRelativeToleranceForF;
}

bool CmRealFunction::mIsConvergedForX(double x1, double x2) const {
  const double d = std::fabs(x1 - x2);
  if (mIntegerValued) {
    if (d < 2.0) return true;
  } else if (d < mGetAbsoluteToleranceForX()) {
    return true;
  }
  return d < mGetRelativeToleranceForX() * std::max(std::fabs(x1), std::fabs(x2));
}

bool CmRealFunction::mIsConvergedForF(double f) const {
  const double a = std::fabs(f);
  if (a <= mAbsoluteToleranceForF) return true;
  return a <= std::fabs(mTarget) * mRelativeToleranceForF;
}

double mRootOfQuadratic(double a, double b, double c) {
  const double d = b * b - 4.0 * a * c;
  if (!(d >= 0.0)) return mGetMissingValueCode();
  return (mSqrt(d, true) - b) / (a + a);
}

double mRootFinder(double x1, double x2, CmRealFunction& f, int* status) {
  if (status) *status = qelOk;
  double f1 = f(x1);
  double f2 = f(x2);
  if (mIsNumericMissing(f1) || mIsNumericMissing(f2)) {
    if (status) *status = qelFailRootNoValue;
    return mGetMissingValueCode();
  }

  double x;
  if (strictlyOpposite(f1, f2)) {
    // The side of the x1 end never changes: x1 is only replaced by points on
    // its own side. Keeping it as a flag means that the halving of f1 (which
    // may underflow to zero) cannot disturb the sign tests.
    const bool lowerEndAbove = isAbove(f1);
    for (;;) {
      x = x1 - f1 / (f2 - f1) * (x2 - x1);
      const double fx = f(x);
      if (f.mIsConvergedForF(fx) || f.mIsConvergedForX(x1, x2)) break;
      if (std::isnan(x) || std::isnan(fx)) {
        // No further step can make progress (an infinite or NaN function
        // value): the function has no usable value here.
        if (status) *status = qelFailRootNoValue;
        return mGetMissingValueCode();
      }
      if (lowerEndAbove == isAbove(fx)) {
        x1 = x;
        f1 = fx;
        f2 /= 2.0;
      } else {
        x2 = x;
        f2 = fx;
        f1 /= 2.0;
      }
    }
    if (f.mIntegerValued) {
      // The halved values keep their sides: rebuild them from the flag so
      // that an underflow to zero cannot pass for a root.
      const double side1 = lowerEndAbove ? 1.0 : -1.0;
      return integerRoot(f, x1, side1, x2, -side1);
    }
    return x;
  }

  if (f.mIsConvergedForF(f1)) {
    x = x1;
  } else if (f.mIsConvergedForF(f2)) {
    x = x2;
    x1 = x2;
  } else {
    if (status) *status = qelFailRootNoBracket;
    return mGetMissingValueCode();
  }
  return f.mIntegerValued ? integerRoot(f, x1, f1, x2, f2) : x;
}

int mBracketFinder(double* x1, double* x2, CmRealFunction& f, double lower, double upper) {
  *x1 = std::max(*x1, lower);
  *x2 = std::min(*x2, upper);
  double f1 = f(*x1);
  double f2 = f(*x2);
  if (mIsNumericMissing(f1) && mIsNumericMissing(f2)) return qelFailRootNoBracket;

  // Move each end with no value halfway towards the other; the other end has
  // a value, so this ends at the latest when the two ends meet.
  while (mIsNumericMissing(f1)) {
    *x1 = (*x1 + *x2) / 2.0;
    f1 = f(*x1);
  }
  while (mIsNumericMissing(f2)) {
    *x2 = (*x1 + *x2) / 2.0;
    f2 = f(*x2);
  }

  if (strictlyOpposite(f1, f2) || f.mIsConvergedForF(f1) || f.mIsConvergedForF(f2)) return qelOk;

  // Expand from the end where |f| is smaller, doubling the step each time.
  double xp, fp, step;
  if (std::fabs(f2) <= std::fabs(f1)) {
    xp = *x2;
    fp = f2;
    step = (*x2 - *x1) / 2.0;
  } else {
    xp = *x1;
    fp = f1;
    step = (*x1 - *x2) / 2.0;
  }
  // Coinciding ends inside the limits (or a NaN end) give no direction to
  // expand in: the expansion would never move.
  if ((step == 0.0 && lower < xp && xp < upper) || std::isnan(step)) return qelFailRootNoBracket;

  bool found = false;
  bool atLimit = false;
  double xn;
  for (;;) {
    xn = xp + step;
    if (f.mIntegerValued) xn = step > 0.0 ? std::ceil(xn) : std::floor(xn);
    if (lower >= xn) {
      xn = lower;
      atLimit = true;
    } else if (xn >= upper) {
      xn = upper;
      atLimit = true;
    }
    const double fn = f(xn);
    if (mIsNumericMissing(fn)) return qelFailRootNoBracket;
    found = f.mIsConvergedForF(fn) || (isAbove(fp) != isAbove(fn));
    if (found || atLimit) break;
    xp = xn;
    fp = fn;
    step *= 2.0;
  }
  *x1 = std::min(xp, xn);
  *x2 = std::max(xp, xn);
  return found ? qelOk : qelFailRootNoBracket;
}

double mGoldenSection(double x1, double x2, CmRealFunction& f, bool integerResult) {
  // Evaluated for the side effects a subclass may have; the values are not
  // used.
  f(x1);
  f(x2);
  double a = x1;
  double b = x2;
  double xl = a + kGoldenSmall * (b - a);
  double xu = a + kGoldenLarge * (b - a);
  double fl = f(xl);
  double fu = f(xu);
  if (mIsNumericMissing(fl) || mIsNumericMissing(fu)) return mGetMissingValueCode();
  // An infinite or NaN bracket never meets the convergence test.
  if (!std::isfinite(xl) || !std::isfinite(xu)) return mGetMissingValueCode();

  while (!f.mIsConvergedForX(xu, xl)) {
    if (fu > fl) {
      b = xu;
      xu = xl;
      fu = fl;
      xl = a + kGoldenSmall * (b - a);
      fl = f(xl);
    } else {
      a = xl;
      xl = xu;
      fl = fu;
      xu = a + kGoldenLarge * (b - a);
      fu = f(xu);
    }
  }
  if (!integerResult) return (xl + xu) / 2.0;

  // Walk up to the integer local minimum, not past the upper end of the
  // search interval.
  double n = std::floor(xl);
  const double last = std::ceil(std::max(x1, x2));
  while (n < last && f(n) > f(n + 1.0)) n += 1.0;
  return n;
}

}  // namespace qel
