// No argument, however bad, may raise a floating-point trap in the armed
// state: the normal, t and hypergeometric routines answer through their
// status instead.
#include <gtest/gtest.h>
#include <qel/distributions.h>
#include <qel/elv.h>

#include <exception>
#include <limits>

#include "utilities/elv/t_internal.h"

namespace {

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
constexpr double kInf = std::numeric_limits<double>::infinity();

TEST(ElvNormalTFamily, BadArgumentsDoNotTrapWhenArmed) {
  const double bad[] = {kNaN, -kInf, -1e300, -40.0, -1.0, 0.0, 1e-320, 0.5, 1.0, 38.0, 1e300, kInf};
  int runs = 0;
  qel::SetLynFpuStates();
  try {
    for (double u : bad) {
      for (double v : bad) {
        double a = 0, b = 0, c = 0;
        unsigned long k = 0;
        normal_df(u, &a, &b);
        inv_normal_df(u, &a);
        normal_upper_quant(u, &a);
        Tha_c(&a, u, v);
        a = t_saddle_approx(u, v, 2.0);
        a = t_saddle_approx(-1.0, u, v);
        a = t_saddle_approx(u, 1e6, v);
        a = qel::elv::t_saddle_integral(u, v, 2.0);
        a = t_expansion_approx(u, 3.0, v);
        a = t_expansion_approx(u, v, 2.0);
        hypergeo_df(3, 10, 4, 5, &a, &b, &c);
        t_df(u, v, &a, &b);
        t_ncdf(u, v, 2.0, &a, &b);
        t_ncdf(u, 3.0, v, &a, &b);
        t_ncdf(-1.0, u, v, &a, &b);
        t_upper_quant(u, v, &a);
        t_lower_quant(u, v, &a);
        hypergeo_lower_quant(1000, 300, 200, &k, &a, u);
        hypergeo_upper_quant(1000, 700, 200, &k, &a, u);
        ++runs;
      }
    }
  } catch (const std::exception& e) {
    ADD_FAILURE() << "trap: " << e.what() << " after " << runs << " runs";
  }
  qel::ResetFpuStates();
  EXPECT_EQ(runs, 144);
}

}  // namespace
