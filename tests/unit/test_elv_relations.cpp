// Identities between the ELV routines that no single reference row shows:
// reflections and mirrored arguments give exchanged tails, the central law
// is the noncentral one at zero noncentrality, forms of one quantity agree
// where they meet, and the mixture sums report start, peak and end in the
// order of their direction.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <array>
#include <cmath>

#include "utilities/elv/t_internal.h"

namespace {

struct Pair {
  double lower = -1, upper = -1;
};

TEST(ElvRelations, ZeroNoncentralityIsTheCentralLaw) {
  double density;
  Pair c, n;
  beta_df(0.3, 2.0, 3.0, &c.lower, &c.upper, &density);
  beta_ncdf(0.3, 2.0, 3.0, 0.0, &n.lower, &n.upper);
  EXPECT_EQ(n.lower, c.lower);
  EXPECT_EQ(n.upper, c.upper);
  gamma_df(3.0, 2.5, &c.lower, &c.upper, &density);
  gamma_ncdf(3.0, 2.5, 0.0, &n.lower, &n.upper);
  EXPECT_EQ(n.lower, c.lower);
  EXPECT_EQ(n.upper, c.upper);
  chi2_df(7.5, 3.0, &c.lower, &c.upper, &density);
  chi2_ncdf(7.5, 3.0, 0.0, &n.lower, &n.upper);
  EXPECT_EQ(n.lower, c.lower);
  F_df(2.0, 3.0, 4.0, &c.lower, &c.upper);
  F_ncdf(2.0, 3.0, 4.0, 0.0, &n.lower, &n.upper);
  EXPECT_EQ(n.lower, c.lower);
  // t = 0 of the noncentral t is Phi(-delta).
  normal_df(-1.0, &c.lower, &c.upper);
  t_ncdf(0.0, 7.0, 1.0, &n.lower, &n.upper);
  EXPECT_EQ(n.lower, c.lower);
}

TEST(ElvRelations, MirroredArgumentsExchangeTheTails) {
  // The noncentral beta hops once to its reflection, and no further.
  Pair a, b;
  beta_ncdf(0.5, 2.0, 3.0, 4.0, &a.lower, &a.upper);
  beta_ncdf2(0.5, 3.0, 2.0, 4.0, &b.lower, &b.upper);
  EXPECT_EQ(b.lower, a.upper);
  EXPECT_EQ(b.upper, a.lower);
  t_ncdf(1.7, 9.0, -2.5, &a.lower, &a.upper);
  t_ncdf(-1.7, 9.0, 2.5, &b.lower, &b.upper);
  EXPECT_EQ(a.lower, b.upper);
  EXPECT_EQ(a.upper, b.lower);
  // Binomial quantiles under prob -> 1 - prob.
  long k = 0, k2 = 0;
  double f = 0, f2 = 0;
  binomial_upper_quant(200, 0.05, 0.3, &k, &f);
  binomial_lower_quant(200, 0.05, 0.7, &k2, &f2);
  EXPECT_EQ(k2, 200 - k);
  EXPECT_NEAR(f2, f, 1e-12);
  // Beta quantiles under exchanged shapes.
  double q, q2;
  beta_upper_quant(0.2, 2, 3, &q);
  beta_lower_quant(0.2, 3, 2, &q2);
  EXPECT_NEAR(q, 1.0 - q2, 1e-12);
  // X, n - X, M - X and N - M - n + X describe one hypergeometric table:
  // the four branches give the same numbers (the first two count the
  // complement, so their lower tail is P(X >= k)).
  double l0, u0, m0;
  hypergeo_df(3, 50, 10, 12, &l0, &u0, &m0);
  const unsigned long mirrored[][4] = {{9, 50, 40, 12}, {7, 50, 10, 38}, {31, 50, 38, 40}};
  for (int i = 0; i < 3; ++i) {
    double lower, upper, mass;
    hypergeo_df(mirrored[i][0], mirrored[i][1], mirrored[i][2], mirrored[i][3], &lower, &upper,
                &mass);
    EXPECT_NEAR(lower, i < 2 ? u0 + m0 : l0, 1e-13) << i;
    EXPECT_NEAR(mass, m0, 1e-13) << i;
  }
  // Tha_c(h, a) + Tha_c(a h, 1/a) = Q(h) Q(a h), across the region borders.
  for (const auto& p :
       {std::array<double, 2>{1.3, 0.6}, {2.0, 0.8}, {0.7, 1.2}, {3.0, 2.5}, {0.0, 0.75}}) {
    const double h = p[0], s = p[1];
    double v1, v2, lower, qh, qah;
    ASSERT_EQ(Tha_c(&v1, h, s), 0);
    ASSERT_EQ(Tha_c(&v2, s * h, 1.0 / s), 0);
    normal_df(h, &lower, &qh);
    normal_df(s * h, &lower, &qah);
    EXPECT_NEAR(v1 + v2, qh * qah, 1e-9 * qh * qah) << "h=" << h << " a=" << s;
  }
}

TEST(ElvRelations, FormsAgreeWhereTheyMeet) {
  // ln(b^a Gamma(b)/Gamma(a+b)) has four forms.
  EXPECT_NEAR(beta_lntab(1e-5, 50.0 - 1e-9), beta_lntab(1e-5, 50.0), 1e-12);
  EXPECT_NEAR(beta_lntab(0.5, 50.0 - 1e-9), beta_lntab(0.5, 50.0), 1e-10);
  EXPECT_NEAR(beta_lntab(1e-5 * (1 - 1e-9), 3.0), beta_lntab(1e-5, 3.0), 1e-13);
  EXPECT_NEAR(beta_lntab(1e-6, 0.006 * (1 - 1e-12)), beta_lntab(1e-6, 0.006), 1e-8);
  // The saddle value of t_ncdf at df = 1000 is the saddle integral.
  Pair t;
  t_ncdf(-3.0, 1000.0, 2.0, &t.lower, &t.upper);
  EXPECT_EQ(t.lower, qel::elv::t_saddle_integral(-3.0, 1000.0, 2.0));
  // Owen's double series near a = 1 needs fewer terms than at a = 0.75.
  double out;
  ASSERT_EQ(Tha_c(&out, 1.0, 0.9999), 0);
  const auto nearOne = ELVsteps1;
  ASSERT_EQ(Tha_c(&out, 1.0, 0.75), 0);
  EXPECT_GE(nearOne, 2);
  EXPECT_GT(ELVsteps1, nearOne);
  EXPECT_LE(ELVsteps1, 200);
}

TEST(ElvRelations, MixtureCountersFollowTheDirection) {
  Pair p;
  // Descending sums (lower tail): start >= peak >= end.
  for (int lowerSide = 0; lowerSide < 2; ++lowerSide) {
    if (lowerSide) {
      beta_ncdf(0.2, 2.0, 8.0, 50.0, &p.lower, &p.upper);
    } else {
      gamma_ncdf(110.0, 100.0, 10.0, &p.lower, &p.upper);
    }
    EXPECT_GE(ELVsteps1, ELVsteps2);
    EXPECT_GE(ELVsteps2, ELVsteps3);
  }
  // Ascending (upper tail): start <= peak <= end.
  gamma_ncdf(111.0, 100.0, 10.0, &p.lower, &p.upper);
  EXPECT_LE(ELVsteps1, ELVsteps2);
  EXPECT_LE(ELVsteps2, ELVsteps3);
}

}  // namespace
