// Noncentral beta distribution as a Poisson mixture with weights of mean L:
// beta_ncdf mixes I_x(a+j, b), beta_ncdf2 mixes I_x(a, b+j). Each tail is
// summed by the two-stage mixture sum of ELVmixture, on components that move
// from index to index by the recurrences of the incomplete beta ratio
//   I_x(A,B) - I_x(A+1,B) = x^A (1-x)^B / (A B(A,B)),
//   I_x(A,B+1) - I_x(A,B) = x^A (1-x)^B / (B B(A,B)).
// The tail summed first is the one that is small where the argument lies
// (below or above the split); a sum that passes 0.9 hands over to the other
// tail, so that the tail returned directly is always the smaller one.
#include <qel/elv.h>

#include <cmath>
#include <stdexcept>
#include <utility>

#include "utilities/elv/limits.h"
#include "utilities/elv/mixture.h"

namespace {

using namespace qel::elv;

// Logarithm of a factor that an extreme argument may have left at 0: the
// term then counts as underflowed.
double logOrLow(double v) {
  return v > 0.0 ? std::log(v) : -kHuge;
}

// beta_ncdf, lower tails F(j) = I_x(A, b), A = a+j, with factor K(j) =
// beta_Iabx(A, b, x), F = density(A, b, x) K. Downwards:
//   F(j-1)/F(j) = 1 + (1-x)/((A+b-1) K),  K(j-1) = (K (A+b-1) + 1-x) x/(A-1).
// With a = 0, F(0) = 1 and its factor is never used.
class FirstShapeLower : public MixtureComponents {
 public:
  FirstShapeLower(double a, double b, double x) : a_(a), b_(b), x_(x) {}
  int series(long j, double* factor) const override { return beta_Iabx(factor, a_ + j, b_, x_); }
  double step(long j, double* factor) const override {
    // A - 1 = a + (j - 1), not (a + j) - 1: a shape below the spacing of
    // the doubles near j (df1 = 1e-16) would vanish from the difference.
    const double previous = a_ + static_cast<double>(j - 1);
    const double ratio = 1.0 + (1.0 - x_) / ((previous + b_) * *factor);
    *factor = previous > 0.0 ? (*factor * (previous + b_) + 1.0 - x_) * x_ / previous : 1.0;
    return ratio;
  }
  double logComponent(long j, double factor) const override {
    if (a_ + j == 0.0) return 0.0;
    double lp;
    lnpbeta(&lp, a_ + j, b_, x_);
    return lp + logOrLow(factor);
  }

 private:
  double a_, b_, x_;
};

// beta_ncdf, upper tails F(j) = 1 - I_x(A, b) with factor J(j) =
// beta_Jabx(A, b, x), F = density(A, b, x) ((1-x)/b) J. Upwards:
//   F(j+1)/F(j) = 1 + x b/(A J),  J(j+1) = (A J/x + b)/(A+b).
class FirstShapeUpper : public MixtureComponents {
 public:
  FirstShapeUpper(double a, double b, double x) : a_(a), b_(b), x_(x) {}
  int series(long j, double* factor) const override { return beta_Jabx(factor, a_ + j, b_, x_); }
  double step(long j, double* factor) const override {
    const double A = a_ + j;
    const double ratio = 1.0 + x_ * b_ / (A * *factor);
    *factor = (A * *factor / x_ + b_) / (A + b_);
    return ratio;
  }
  double logComponent(long j, double factor) const override {
    double lp;
    lnpbeta(&lp, a_ + j, b_, x_);
    return lp + std::log1p(-x_) - std::log(b_) + logOrLow(factor);
  }

 private:
  double a_, b_, x_;
};

// beta_ncdf2, upper tails F(j) = 1 - I_x(a, B), B = b+j, with factor
// J(j) = beta_Jabx(a, B, x), F = density(a, B, x) ((1-x)/B) J. Downwards:
//   F(j-1)/F(j) = 1 + x B/((a+B-1)(1-x) J),  J(j-1) = (a+B-1)(1-x) J/B + x.
// With b = 0, F(0) = 1 and its factor is never used.
class SecondShapeUpper : public MixtureComponents {
 public:
  SecondShapeUpper(double a, double b, double x) : a_(a), b_(b), x_(x) {}
  int series(long j, double* factor) const override { return beta_Jabx(factor, a_, b_ + j, x_); }
  double step(long j, double* factor) const override {
    const double B = b_ + j;
    const double ratio = 1.0 + x_ * B / ((a_ + B - 1.0) * (1.0 - x_) * *factor);
    *factor = (a_ + B - 1.0) * (1.0 - x_) * *factor / B + x_;
    return ratio;
  }
  double logComponent(long j, double factor) const override {
    const double B = b_ + j;
    if (B == 0.0) return 0.0;
    double lp;
    lnpbeta(&lp, a_, B, x_);
    return lp + std::log1p(-x_) - std::log(B) + logOrLow(factor);
  }

 private:
  double a_, b_, x_;
};

// beta_ncdf2, lower tails F(j) = I_x(a, B) with factor K(j) =
// beta_Iabx(a, B, x), F = density(a, B, x) K. Upwards:
//   F(j+1)/F(j) = 1 + x(1-x)/(B K),  K(j+1) = (K B/(1-x) + x)/(a+B).
class SecondShapeLower : public MixtureComponents {
 public:
  SecondShapeLower(double a, double b, double x) : a_(a), b_(b), x_(x) {}
  int series(long j, double* factor) const override { return beta_Iabx(factor, a_, b_ + j, x_); }
  double step(long j, double* factor) const override {
    const double B = b_ + j;
    const double ratio = 1.0 + x_ * (1.0 - x_) / (B * *factor);
    *factor = (*factor * B / (1.0 - x_) + x_) / (a_ + B);
    return ratio;
  }
  double logComponent(long j, double factor) const override {
    double lp;
    lnpbeta(&lp, a_, b_ + j, x_);
    return lp + logOrLow(factor);
  }

 private:
  double a_, b_, x_;
};

// One mixture: which shape moves and the arguments.
struct Mixture {
  bool secondShape;  // beta_ncdf2
  double a, b, x;
};

// Descending sums run over the tail that is small below the split for
// beta_ncdf (lower) and above it for beta_ncdf2 (upper).
MixtureResult runSum(const Mixture& m, bool descending, const MixtureSettings& settings) {
  // A shape of 0 makes the component at index 0 a point mass: I_x(0,b) = 1,
  // I_x(a,0) = 0. The ascending sums over the vanishing tail start at 1.
  const double moving = m.secondShape ? m.b : m.a;
  if (descending) {
    const long k = descendingMixtureStart(settings.L);
    if (m.secondShape) return descendingMixtureSum(SecondShapeUpper(m.a, m.b, m.x), k, settings);
    return descendingMixtureSum(FirstShapeLower(m.a, m.b, m.x), k, settings);
  }
  long k = ascendingMixtureStart(settings.L);
  if (k > 0) --k;
  if (moving == 0.0 && k == 0) k = 1;
  if (m.secondShape) return ascendingMixtureSum(SecondShapeLower(m.a, m.b, m.x), k, settings);
  return ascendingMixtureSum(FirstShapeUpper(m.a, m.b, m.x), k, settings);
}

// The sums and their combination, after the checks and the reflection.
void mixtureTails(const char* name, const Mixture& m, double L, double* lower, double* upper) {
  const int64_t base = m.secondShape ? 1000 : 0;
  ELVstartup(name);
  ELVmethod = base;
  if (m.x < kTinyArgument || m.x == 1.0) {
    *lower = m.x == 1.0 ? 1.0 : 0.0;
    *upper = 1.0 - *lower;
    ELVexit(name, 0, 'F');
    return;
  }
  // A fixed shape of 0 puts all mass at one end: I_x(a+j, 0) = 0 and
  // I_x(0, b+j) = 1 for every x below 1.
  if ((m.secondShape ? m.a : m.b) == 0.0) {
    *lower = m.secondShape ? 1.0 : 0.0;
    *upper = 1.0 - *lower;
    ELVexit(name, 0, 'F');
    return;
  }
  const double split = m.secondShape ? m.a / (m.a + m.b + L) : (m.a + L) / (m.a + m.b + L);
  // beta_ncdf sums the lower tail from the top at or below the split;
  // beta_ncdf2 sums the upper tail from the top at or above it.
  const bool descending = m.secondShape ? m.x >= split : m.x <= split;
  const bool lowerFirst = descending != m.secondShape;
  MixtureSettings settings;
  settings.L = L;
  MixtureResult result;
  int64_t method;
  double* directOut = lowerFirst ? lower : upper;
  double* otherOut = lowerFirst ? upper : lower;
  try {
    result = runSum(m, descending, settings);
    method = mixtureMethod(result, descending);
    if (result.end == MixtureEnd::AboveLimit) {
      settings.switchAbove = kHuge;
      result = runSum(m, !descending, settings);
      method = 100 + mixtureMethod(result, !descending);
      std::swap(directOut, otherOut);
    }
  } catch (const std::runtime_error&) {
    // Shapes at the edge of the double range (1e-300 beside 1e8) can make a
    // recurrence overflow in the armed state: the sum has failed.
    ELVmethod = base;
    ELVexit(name, 4, 'F');
    return;
  }
  *directOut = result.sum;
  *otherOut = 1.0 - result.sum;
  ELVmethod = base + method;
  ELVsteps1 = result.start;
  ELVsteps2 = result.peak;
  ELVsteps3 = result.last;
  ELVexit(name, mixtureCode(result), 'F');
}

// Checks shared by both routines; true when the run ends here.
bool refused(const char* name, double x, double a, double b, double L) {
  if (isNan(x) || anyNan(a, b, L) || a < 0.0 || b < 0.0 || x < 0.0 || L < 0.0 || x > 1.0 ||
      a > kMaxShape || b > kMaxShape) {
    ELVexit(name, 2, 'F');
    return true;
  }
  if (a + L + kWidthFactor * std::sqrt(L) > kMaxShape) {
    ELVexit(name, 3, 'F');
    return true;
  }
  return false;
}

}  // namespace

extern "C" {

void beta_ncdf(double x, double a, double b, double L, double* lower, double* upper) {
  static const char* const name = "beta_ncdf";
  if (refused(name, x, a, b, L)) return;
  if (L < kTinyArgument) {
    double density;
    beta_df(x, a, b, lower, upper, &density);
    ELVexit(name, 0, 'N');
    return;
  }
  // Above 1/2 the mirror image: 1 - I_x(a+j, b) = I_(1-x)(b, a+j).
  if (x > 0.5) {
    beta_ncdf2(1.0 - x, b, a, L, upper, lower);
    return;
  }
  mixtureTails(name, {false, a, b, x}, L, lower, upper);
}

void beta_ncdf2(double x, double a, double b, double L, double* lower, double* upper) {
  static const char* const name = "beta_ncdf2";
  if (refused(name, x, a, b, L)) return;
  if (L < kTinyArgument) {
    double density;
    beta_df(x, a, b, lower, upper, &density);
    ELVexit(name, 0, 'N');
    return;
  }
  // At or above 1/2 the mirror image; beta_ncdf reflects only above 1/2, so
  // x = 1/2 is reflected once.
  if (x >= 0.5) {
    beta_ncdf(1.0 - x, b, a, L, upper, lower);
    return;
  }
  mixtureTails(name, {true, a, b, x}, L, lower, upper);
}

}  // extern "C"
