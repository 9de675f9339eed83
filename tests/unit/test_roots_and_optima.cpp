// Root finding, bracketing and golden-section minimisation on functions with
// known roots and minima, including the termination rules at the edges: ends
// that are roots, ends without a value, integer arguments, empty brackets.
#include <gtest/gtest.h>
#include <qel/basic_types.h>

#include <cmath>
#include <functional>
#include <limits>
#include <stdexcept>
#include <vector>

#include "utilities/LYNBasicTypes.h"
#include "utilities/RootsAndOptima.h"

namespace {

using qel::mGetMissingValueCode;

// A function object over a lambda that records where it was evaluated.
class Lambda : public qel::CmRealFunction {
 public:
  explicit Lambda(std::function<double(double)> g, bool integerValued = false) : g_(std::move(g)) {
    mIntegerValued = integerValued;
  }
  double operator()(double x) override {
    points.push_back(x);
    return g_(x);
  }
  std::vector<double> points;

 private:
  std::function<double(double)> g_;
};

TEST(CmRealFunction, DefaultsCopiesAndConvergenceTests) {
  Lambda f([](double x) { return x; });
  EXPECT_FALSE(f.mIntegerValued);
  EXPECT_EQ(f.mTarget, 0.0);
  EXPECT_EQ(f.mGetAbsoluteToleranceForX(), 1e-30);
  EXPECT_EQ(f.mGetRelativeToleranceForX(), 1e-12);
  EXPECT_EQ(f.mGetAbsoluteToleranceForF(), 1e-30);
  EXPECT_EQ(f.mGetRelativeToleranceForF(), 1e-12);

  // Relative test on x, strict.
  EXPECT_TRUE(f.mIsConvergedForX(1000.0, 1000.0 + 1e-10));
  EXPECT_FALSE(f.mIsConvergedForX(1.0, 1.0 + 1e-11));
  EXPECT_TRUE(f.mIsConvergedForX(0.0, 5e-31));
  EXPECT_FALSE(f.mIsConvergedForX(0.0, 1e-30));
  // An integer argument converges once the ends are less than 2 apart.
  Lambda g([](double x) { return x; }, true);
  EXPECT_TRUE(g.mIsConvergedForX(4.0, 5.9));
  EXPECT_FALSE(g.mIsConvergedForX(4.0, 6.0));

  // The relative test on f is scaled by the target.
  EXPECT_TRUE(f.mIsConvergedForF(-1e-30));
  EXPECT_FALSE(f.mIsConvergedForF(1e-20));
  f.mTarget = -1e9;
  EXPECT_TRUE(f.mIsConvergedForF(1e-3));
  EXPECT_FALSE(f.mIsConvergedForF(2e-3));
  EXPECT_FALSE(f.mIsConvergedForF(std::nan("")));

  f.mIntegerValued = true;
  f.mAbsoluteToleranceForX = 3.0;
  g = f;
  EXPECT_TRUE(g.mIntegerValued);
  EXPECT_EQ(g.mTarget, -1e9);
  EXPECT_EQ(g.mAbsoluteToleranceForX, 3.0);
}

// The x test goes through the accessor slots, the f test through the fields.
TEST(CmRealFunction, XTestUsesOverriddenAccessors) {
  struct Loose : Lambda {
    Loose() : Lambda([](double x) { return x; }) {}
    double mGetAbsoluteToleranceForX() const override { return 0.5; }
    double mGetAbsoluteToleranceForF() const override { return 0.5; }
  } f;
  EXPECT_TRUE(f.mIsConvergedForX(0.0, 0.4));
  EXPECT_FALSE(f.mIsConvergedForF(0.4));
}

TEST(RootOfQuadratic, LargerRootOrMissing) {
  EXPECT_EQ(qel::mRootOfQuadratic(1.0, -3.0, 2.0), 2.0);
  EXPECT_EQ(qel::mRootOfQuadratic(-1.0, 3.0, -2.0), 1.0);
  EXPECT_DOUBLE_EQ(qel::mRootOfQuadratic(1.0, 0.0, -2.0), std::sqrt(2.0));
  EXPECT_EQ(qel::mRootOfQuadratic(1.0, 0.0, 1.0), mGetMissingValueCode());
  EXPECT_EQ(qel::mRootOfQuadratic(std::nan(""), 0.0, 1.0), mGetMissingValueCode());
}

// Roots of smooth functions (a bracket in descending order too), roots at an
// end of the bracket, and integer arguments: the smallest integer past the
// sign change (a zero at an integer has reached the other side; without a
// strict change, the floor of the root end).
TEST(RootFinder, KnownRoots) {
  const struct {
    double (*f)(double);
    bool integer;
    double a, b, root, tolerance;
  } cases[] = {
      {[](double x) { return x * x * x - 2.0; }, false, 0.0, 2.0, std::cbrt(2.0), 2e-12},
      {[](double x) { return std::exp(-x) - 0.25; }, false, 10.0, 0.0, std::log(4.0), 1e-11},
      {[](double x) { return x - 1.0; }, false, 1.0, 3.0, 1.0, 0.0},
      {[](double x) { return x - 3.0; }, false, 1.0, 3.0, 3.0, 0.0},
      {[](double x) { return std::floor(x) * std::floor(x) - 10.0; }, true, 0.0, 100.0, 4.0, 0.0},
      {[](double x) { return 100.0 - std::pow(2.0, std::floor(x)); }, true, 0.0, 20.0, 7.0, 0.0},
      {[](double x) { return x - 5.0; }, true, 0.0, 10.0, 5.0, 0.0},
      {[](double x) { return x - 5.0; }, true, 0.0, 1000.0, 5.0, 0.0},
      {[](double x) { return x - 5.5; }, true, 5.5, 9.0, 5.0, 0.0},
  };
  for (const auto& c : cases) {
    Lambda f(c.f, c.integer);
    int status = -1;
    EXPECT_NEAR(qel::mRootFinder(c.a, c.b, f, &status), c.root, c.tolerance) << c.a << " " << c.b;
    EXPECT_EQ(status, qel::qelOk);
  }
  // A root at an end: only the two ends are evaluated.
  Lambda atUpper([](double x) { return x - 3.0; });
  int status = -1;
  qel::mRootFinder(1.0, 3.0, atUpper, &status);
  EXPECT_EQ(atUpper.points.size(), 2u);

  // A target subtracted by the subclass; the relative test on f scales with it.
  struct Square : qel::CmRealFunction {
    double operator()(double x) override { return x * x - mTarget; }
  } square;
  square.mTarget = 1e20;
  EXPECT_NEAR(qel::mRootFinder(0.0, 1e12, square, &status), 1e10, 1e-1);
  EXPECT_EQ(status, qel::qelOk);
}

TEST(RootFinder, NoSignChangeAndNoValue) {
  int status = -1;
  Lambda positive([](double x) { return x * x + 1.0; });
  EXPECT_EQ(qel::mRootFinder(-1.0, 2.0, positive, &status), mGetMissingValueCode());
  EXPECT_EQ(status, qel::qelFailRootNoBracket);

  Lambda partial([](double x) { return x > 2.5 ? mGetMissingValueCode() : x - 1.0; });
  EXPECT_EQ(qel::mRootFinder(0.0, 3.0, partial, &status), mGetMissingValueCode());
  EXPECT_EQ(status, qel::qelFailRootNoValue);

  // The bracket finder repairs it by bisecting the end towards x1.
  double x1 = 0.0, x2 = 3.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, partial, 0.0, 3.0), qel::qelOk);
  EXPECT_EQ(x1, 0.0);
  EXPECT_EQ(x2, 1.5);
  EXPECT_NEAR(qel::mRootFinder(x1, x2, partial, &status), 1.0, 1e-12);
  EXPECT_EQ(status, qel::qelOk);
}

TEST(RootFinder, ExceptionsOfTheFunctionPassThrough) {
  int status = -1;
  Lambda throwing([](double x) -> double {
    if (x > 0.4 && x < 0.6) throw std::overflow_error("in f");
    return x - 0.5;
  });
  EXPECT_THROW(qel::mRootFinder(0.0, 1.0, throwing, &status), std::overflow_error);
}

// A function that is the smallest subnormal on the left of 0.5 and 0.5 - x
// from there on, with all tolerances on f at 0: the retained end's value is
// halved to zero many times. Sign tests on the halved values would take the
// left end for a root; the finder must still close in on 0.5.
TEST(RootFinder, IllinoisHalvingDoesNotAffectSignTests) {
  const double tiny = std::numeric_limits<double>::denorm_min();
  Lambda f([tiny](double x) { return x < 0.5 ? tiny : 0.5 - x; });
  f.mAbsoluteToleranceForF = 0.0;
  f.mRelativeToleranceForF = 0.0;
  int status = -1;
  const double root = qel::mRootFinder(0.0, 1.0, f, &status);
  EXPECT_EQ(status, qel::qelOk);
  EXPECT_NEAR(root, 0.5, 1e-11);
}

TEST(BracketFinder, ExpandsShrinksAndRespectsLimits) {
  // Expansion from the end with the smaller |f|, doubling the step.
  Lambda f([](double x) { return x - 10.0; });
  double x1 = 0.0, x2 = 1.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, f, -100.0, 100.0), qel::qelOk);
  EXPECT_LE(x1, 10.0);
  EXPECT_GE(x2, 10.0);
  EXPECT_LT(x1, x2);
  // 1 -> 1.5 -> 2.5 -> 4.5 -> 8.5 -> 16.5
  EXPECT_EQ(x1, 8.5);
  EXPECT_EQ(x2, 16.5);

  // Expansion downwards, stopped by the lower limit without success.
  Lambda g([](double x) { return x + 1000.0; });
  x1 = 0.0;
  x2 = 1.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, g, -50.0, 10.0), qel::qelFailRootNoBracket);
  EXPECT_EQ(x1, -50.0);
  EXPECT_LT(x1, x2);

  // The limit itself may hold the change.
  x1 = 0.0;
  x2 = 1.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, g, -1000.0, 10.0), qel::qelOk);
  EXPECT_EQ(x1, -1000.0);

  // Integer arguments expand on whole numbers.
  Lambda h([](double x) { return x - 37.0; }, true);
  x1 = 0.0;
  x2 = 3.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, h, 0.0, 1000.0), qel::qelOk);
  EXPECT_EQ(x1, std::floor(x1));
  EXPECT_EQ(x2, std::floor(x2));
  EXPECT_LE(x1, 37.0);
  EXPECT_GE(x2, 37.0);

  // A function with no value beyond 20 ends the expansion with 30021 and
  // leaves the bracket as it was before the expansion.
  Lambda partial([](double x) { return x > 20.0 ? mGetMissingValueCode() : 100.0 - x; });
  x1 = 0.0;
  x2 = 4.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, partial, -1e9, 1e9), qel::qelFailRootNoBracket);
  EXPECT_EQ(x1, 0.0);
  EXPECT_EQ(x2, 4.0);
}

TEST(BracketFinder, EqualLimitsAndMissingEnds) {
  Lambda f([](double x) { return x - 5.0; });
  double x1 = 0.0, x2 = 10.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, f, 3.0, 3.0), qel::qelFailRootNoBracket);
  EXPECT_EQ(x1, 3.0);
  EXPECT_EQ(x2, 3.0);
  x1 = 0.0;
  x2 = 10.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, f, 5.0, 5.0), qel::qelOk);
  EXPECT_EQ(x1, 5.0);
  EXPECT_EQ(x2, 5.0);

  // Coinciding ends strictly inside the limits cannot expand.
  x1 = x2 = 1.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, f, 0.0, 10.0), qel::qelFailRootNoBracket);

  Lambda none([](double) { return mGetMissingValueCode(); });
  x1 = 0.0;
  x2 = 1.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, none, 0.0, 1.0), qel::qelFailRootNoBracket);

  // Missing on the left: x1 moves halfway towards x2 until it has a value.
  Lambda left([](double x) { return x < 7.0 ? mGetMissingValueCode() : x - 9.0; });
  x1 = 0.0;
  x2 = 10.0;
  EXPECT_EQ(qel::mBracketFinder(&x1, &x2, left, 0.0, 10.0), qel::qelOk);
  EXPECT_EQ(x1, 7.5);
  EXPECT_EQ(x2, 10.0);
}

TEST(GoldenSection, MinimaOfRealAndIntegerFunctions) {
  Lambda parabola([](double x) { return (x - 2.0) * (x - 2.0) + 1.0; });
  EXPECT_NEAR(qel::mGoldenSection(0.0, 5.0, parabola, false), 2.0, 1e-7);
  // Both ends are evaluated first.
  ASSERT_GE(parabola.points.size(), 2u);
  EXPECT_EQ(parabola.points[0], 0.0);
  EXPECT_EQ(parabola.points[1], 5.0);

  Lambda shifted([](double x) { return std::cosh(x - 0.3); });
  EXPECT_NEAR(qel::mGoldenSection(-4.0, 1.0, shifted, false), 0.3, 1e-7);

  // Integer result: the walk from floor(xl) to the integer local minimum.
  Lambda near37([](double x) { return (x - 3.7) * (x - 3.7); }, true);
  EXPECT_EQ(qel::mGoldenSection(0.0, 10.0, near37, true), 4.0);
  Lambda near32([](double x) { return (x - 3.2) * (x - 3.2); }, true);
  EXPECT_EQ(qel::mGoldenSection(0.0, 10.0, near32, true), 3.0);

  Lambda noValue([](double x) { return x > 2.0 ? mGetMissingValueCode() : x; });
  EXPECT_EQ(qel::mGoldenSection(0.0, 5.0, noValue, false), mGetMissingValueCode());
}

}  // namespace
