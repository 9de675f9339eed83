// Noncentral gamma distribution: the Poisson mixture over j of P(a+j, x)
// with weights of mean L. Below x = a + L the lower tail is summed from the
// top index downwards, above it the upper tail from the bottom upwards; a sum
// that passes 0.9 hands over to the other tail, so that the tail returned
// directly is always the smaller one.
#include <qel/elv.h>

#include <cmath>
#include <utility>

#include "utilities/elv/limits.h"
#include "utilities/elv/mixture.h"

namespace {

using namespace qel::elv;

// Lower tails F(j) = P(a+j, x) = g(j) I(j) with g(j) = x^(a+j) e^-x /
// Gamma(a+j+1) and I(j) the series of gamma_Iax at shape a+j, which obeys
// I(j-1) = 1 + x/(a+j) I(j). Index 0 is valid for a = 0 (P(0, x) = 1).
class GammaLowerTails : public MixtureComponents {
 public:
  GammaLowerTails(double a, double x) : a_(a), x_(x) {}
  int series(long j, double* factor) const override { return gamma_Iax(factor, a_ + j, x_); }
  double step(long j, double* factor) const override {
    const double ratio = (a_ + j) / (x_ * *factor) + 1.0;
    *factor = 1.0 + x_ / (a_ + j) * *factor;
    return ratio;
  }
  double logComponent(long j, double factor) const override {
    double logG;
    lnpgamma(&logG, a_ + j + 1.0, x_);
    return logG + std::log(factor);
  }

 private:
  double a_, x_;
};

// Upper tails F(j) = Q(a+j, x) = p(a+j, x) J(j) with p the gamma density and
// J(j) the factor of gamma_Jax, which obeys J(j+1) = 1 + (a+j)/x J(j).
class GammaUpperTails : public MixtureComponents {
 public:
  GammaUpperTails(double a, double x) : a_(a), x_(x) {}
  int series(long j, double* factor) const override { return gamma_Jax(factor, a_ + j, x_); }
  double step(long j, double* factor) const override {
    // For a tiny shape Q(a+1,x)/Q(a,x) is about 1/a: held finite.
    const double scaled = (a_ + j) * *factor;
    const double ratio = scaled > x_ * 1e-300 ? x_ / scaled + 1.0 : kHuge;
    *factor = 1.0 + (a_ + j) / x_ * *factor;
    return ratio;
  }
  double logComponent(long j, double factor) const override {
    double logP;
    lnpgamma(&logP, a_ + j, x_);
    return logP + std::log(factor);
  }

 private:
  double a_, x_;
};

MixtureResult runSum(bool descending, double a, double x, const MixtureSettings& settings) {
  if (descending) {
    const long k = descendingMixtureStart(settings.L);
    return descendingMixtureSum(GammaLowerTails(a, x), k, settings);
  }
  long k = ascendingMixtureStart(settings.L);
  // Q(0, x) = 0 for x > 0: with a = 0 the sum starts at index 1.
  if (a == 0.0 && k == 0) k = 1;
  return ascendingMixtureSum(GammaUpperTails(a, x), k, settings);
}

}  // namespace

extern "C" {

void gamma_ncdf(double x, double a, double L, double* lower, double* upper) {
  static const char* const name = "gamma_ncdf";
  if (anyNan(x, a, L) || a < 0.0 || x < 0.0 || L < 0.0 || a > kMaxShape) {
    ELVexit(name, 2, 'F');
    return;
  }
  if (a + L + kWidthFactor * std::sqrt(L) > kMaxShape) {
    ELVexit(name, 3, 'F');
    return;
  }
  // A noncentrality below the smallest argument differs from 0 by less than
  // any double can show.
  if (L < kTinyArgument) {
    double density;
    gamma_df(x, a, lower, upper, &density);
    ELVexit(name, 0, 'N');
    return;
  }
  ELVstartup(name);
  if (x < kTinyArgument) {
    *lower = 0.0;
    *upper = 1.0;
    ELVsteps1 = 0;
    ELVmethod = 1;
    ELVexit(name, 0, 'F');
    return;
  }
  if (x > kMaxDf) {
    *lower = 1.0;
    *upper = 0.0;
    ELVmethod = 2;
    ELVexit(name, 0, 'F');
    return;
  }
  ELVmethod = 0;
  MixtureSettings settings;
  settings.L = L;
  const bool descending = x <= a + L;
  MixtureResult result = runSum(descending, a, x, settings);
  int64_t method = mixtureMethod(result, descending);
  double direct = result.sum;
  double* directOut = descending ? lower : upper;
  double* otherOut = descending ? upper : lower;
  if (result.end == MixtureEnd::AboveLimit) {
    // The other tail is the smaller one: sum it in its own right.
    settings.switchAbove = kHuge;
    result = runSum(!descending, a, x, settings);
    method = 100 + mixtureMethod(result, !descending);
    direct = result.sum;
    std::swap(directOut, otherOut);
  }
  *directOut = direct;
  *otherOut = 1.0 - direct;
  ELVmethod = method;
  ELVsteps1 = result.start;
  ELVsteps2 = result.peak;
  ELVsteps3 = result.last;
  ELVexit(name, mixtureCode(result), 'F');
}

}  // extern "C"
