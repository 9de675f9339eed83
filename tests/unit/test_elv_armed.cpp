// No argument, however bad, may raise a floating-point trap in the armed
// state (a trap inside a library function would end the process): every
// routine answers through its status, which stays within 0 to 4.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/elv.h>

#include <exception>
#include <functional>
#include <limits>

#include "utilities/elv/t_internal.h"

namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr double kInf = std::numeric_limits<double>::infinity();

// Runs body in the armed state; a trap or a status above 4 fails the test.
void armedSweep(const std::function<void()>& body) {
  qel::SetLynFpuStates();
  try {
    body();
  } catch (const std::exception& e) {
    ADD_FAILURE() << "trap: " << e.what();
  }
  qel::ResetFpuStates();
}

TEST(ElvArmed, NormalTAndHypergeometricTakeAnyArgument) {
  const double bad[] = {kNaN, -kInf, -1e300, -40.0, -1.0, 0.0, 1e-320, 0.5, 1.0, 38.0, 1e300, kInf};
  armedSweep([&] {
    for (double u : bad) {
      for (double v : bad) {
        double a = 0, b = 0, c = 0;
        unsigned long k = 0;
        normal_df(u, &a, &b);
        inv_normal_df(u, &a);
        normal_upper_quant(u, &a);
        Tha_c(&a, u, v);
        a = t_saddle_approx(u, v, 2.0) + t_saddle_approx(-1.0, u, v) + t_saddle_approx(u, 1e6, v);
        a = qel::elv::t_saddle_integral(u, v, 2.0);
        a = t_expansion_approx(u, 3.0, v) + t_expansion_approx(u, v, 2.0);
        hypergeo_df(3, 10, 4, 5, &a, &b, &c);
        t_df(u, v, &a, &b);
        t_ncdf(u, v, 2.0, &a, &b);
        t_ncdf(u, 3.0, v, &a, &b);
        t_ncdf(-1.0, u, v, &a, &b);
        t_upper_quant(u, v, &a);
        t_lower_quant(u, v, &a);
        hypergeo_lower_quant(1000, 300, 200, &k, &a, u);
        hypergeo_upper_quant(1000, 700, 200, &k, &a, u);
        ASSERT_LE(ELVerrno, 4);
      }
    }
  });
}

TEST(ElvArmed, GammaFamilyTakesAnyArgument) {
  const double bad[] = {kNaN, -1.0, 0.0, 1e-320, 1e-300, 1e300, 2e8, kInf};
  armedSweep([&] {
    for (double u : bad) {
      for (double v : bad) {
        double a = 0, b = 0, c = 0;
        long k = 0;
        gamma_df(u, v, &a, &b, &c);
        gamma_ncdf(u, v, 1.0, &a, &b);
        gamma_ncdf(1.0, u, v, &a, &b);
        chi2_ncdf(u, 3.0, v, &a, &b);
        gamma_upper_quant(u, v, &a);
        gamma_lower_quant(u, v, &a);
        poisson_df(3, u, &a, &b, &c);
        poisson_upper_quant(&k, &a, u, v);
        poisson_lower_quant(&k, &a, u, v);
        gamma_ncdf(1.8e8, u, 1.0, &a, &b);  // tiny shapes in the ascending sum
        ASSERT_LE(ELVerrno, 4);
      }
    }
  });
}

// The beta, F and binomial routines over a grid with the edges of the
// admissible ranges.
TEST(ElvArmed, BetaFamilyOverExtremeArguments) {
  const double shapes[] = {0.0, 1e-300, 1e-13, 1e-3, 0.3, 1.0, 2.5, 50.0, 3e4, 9e7, 94906265.0};
  const double xs[] = {0.0, 1e-300, 1e-200, 1e-20, 1e-5, 0.1, 0.5, 0.9, 1.0 - 1e-12, 1.0};
  const double Ls[] = {0.0, 1e-300, 0.01, 3.0, 500.0, 1e4};
  const double ps[] = {1e-12, 1e-6, 0.1, 0.5};
  armedSweep([&] {
    double lower, upper, density, q;
    for (double a : shapes) {
      for (double b : shapes) {
        for (double x : xs) {
          beta_df(x, a, b, &lower, &upper, &density);
          ASSERT_LE(ELVerrno, 4);
          F_df(x * 1e3, 2 * a, 2 * b, &lower, &upper);
          if (a > 1e4 && b > 1e4) continue;  // keep the mixtures short
          for (double L : Ls) {
            beta_ncdf(x, a, b, L, &lower, &upper);
            ASSERT_LE(ELVerrno, 4);
            beta_ncdf2(x, a, b, L, &lower, &upper);
            ASSERT_LE(ELVerrno, 4);
          }
        }
        for (double p : ps) {
          beta_lower_quant(p, a, b, &q);
          ASSERT_LE(ELVerrno, 4);
          beta_upper_quant(p, a, b, &q);
          F_upper_quant(p, 2 * a, 2 * b, &q);
          F_lower_quant(p, 2 * a, 2 * b, &q);
          ASSERT_LE(ELVerrno, 4);
        }
      }
    }
    for (long n : {1L, 2L, 40L, 100000L, 94906265L}) {
      for (double prob : {0.0, 1e-300, 1e-9, 0.3, 0.5, 0.7, 1.0 - 1e-12, 1.0}) {
        for (long k : {0L, 1L, n / 3, n / 2, n - 1, n}) {
          binomial_df(k, n, prob, &lower, &upper, &density);
          ASSERT_LE(ELVerrno, 4);
        }
        for (double p : ps) {
          long k;
          binomial_lower_quant(n, p, prob, &k, &q);
          ASSERT_LE(ELVerrno, 4);
          binomial_upper_quant(n, p, prob, &k, &q);
          ASSERT_LE(ELVerrno, 4);
        }
      }
    }
  });
}

}  // namespace
