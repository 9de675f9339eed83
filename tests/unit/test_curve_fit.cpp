// Polynomial curve fit against R's lm and, ill-conditioned, against exact
// least squares in mpmath (tools/reference/gen_curve_fit_*); kernels, designs.
#include <gtest/gtest.h>
#include <omp.h>
#include <qel/curve_fit.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>
#include <numeric>
#include <vector>

#include "interfaces/linear_modelling/utilities.h"
#include "reference_data.h"

namespace {

namespace ex = qel::v1::experimental;
constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

struct Fit {
  std::vector<double> c;  // degree + 2: intercept, coefficients, sigma
  double r2 = 0.0;
  int code = -1;
};

Fit fit(const std::vector<double>& x, const std::vector<double>& y, unsigned degree,
        bool intercept = true, double tolerance = 0.0) {
  Fit f{std::vector<double>(degree + 2, 7.0)};
  f.code = qel::v1::RunLynGrCurveFit(f.c.data(), &f.r2, x.data(), y.data(),
                                     static_cast<unsigned>(x.size()), degree, tolerance, intercept);
  return f;
}

bool allNaN(const Fit& f) {
  return std::all_of(f.c.begin(), f.c.end(), [](double v) { return std::isnan(v); }) &&
         std::isnan(f.r2);
}

bool close(double actual, double expected, double tolerance) {  // or both NaN
  return std::isnan(expected)
             ? std::isnan(actual)
             : std::fabs(actual - expected) <= tolerance * (1 + std::fabs(expected));
}

// The data of gen_curve_fit_r.R, rebuilt exactly.
void makeData(unsigned n, unsigned d, double seed, double noise, std::vector<double>* x,
              std::vector<double>* y) {
  const double b[] = {1.5, -0.75, 0.25, 0.5, -0.125, 0.0625};
  double state = seed;
  auto next = [&state] {
    state = std::fmod(69069.0 * state + 1.0, 4294967296.0);
    return state / 4294967296.0;
  };
  x->clear();
  y->clear();
  for (unsigned i = 0; i < n; ++i) {
    const double xi = (std::floor(256.0 * next()) - 128.0) / 64.0;
    double yi = 0.0, p = 1.0;
    for (unsigned j = 0; j <= d; ++j, p *= xi) yi += b[j] * p;
    x->push_back(xi);
    y->push_back(yi + noise * (std::floor(1048576.0 * next()) / 1048576.0 - 0.5));
  }
}

TEST(CurveFit, AgreesWithRLm) {
  const auto rows = qeltest::loadReferenceData("curve_fit_r.csv", 0);
  ASSERT_EQ(rows.size(), 50u);
  for (const auto& row : rows) {
    const auto& v = row.numbers;
    const auto n = static_cast<unsigned>(v[0]), d = static_cast<unsigned>(v[1]);
    const bool intercept = v[2] != 0.0;
    std::vector<double> x, y;
    makeData(n, d, v[3], v[4], &x, &y);
    const Fit f = fit(x, y, d, intercept);
    ASSERT_EQ(f.code, qel::qelOk) << "line " << row.line;
    for (unsigned j = 0; j <= d + 1; ++j)  // the coefficients, then sigma past R^2
      EXPECT_TRUE(close(f.c[j], v[5 + j + (j > d)], 1e-9)) << "line " << row.line << " " << j;
    if (d > 0) {  // exact data: R^2 = 1
      EXPECT_NEAR(f.r2, v[4] == 0.0 ? 1.0 : v[6 + d], v[4] == 0.0 ? 1e-15 : 1e-11) << row.line;
    }
  }
}

// Raw powers of x near 1e6: Householder on the design keeps about 7 digits
// of the quadratic, normal equations none. The cubic column is collinear at
// the default tolerance and must come back NaN, with the rest the quadratic.
TEST(CurveFit, IllConditionedRawPowers) {
  std::vector<double> x, y, fitted2;
  std::vector<std::vector<double>> ref(3);
  for (const auto& row : qeltest::loadReferenceData("curve_fit_ill.csv", 1)) {
    const std::string& name = row.text[0];
    if (name == "x") x = row.numbers;
    if (name == "y") y = row.numbers;
    if (name == "fit1") ref[1] = row.numbers;
    if (name == "fit2") ref[2] = row.numbers;
    if (name == "fitted2") fitted2 = row.numbers;
  }
  ASSERT_TRUE(x.size() == 50u && fitted2.size() == 50u);
  const Fit f1 = fit(x, y, 1);
  ASSERT_EQ(f1.code, qel::qelOk);
  const double got[4] = {f1.c[0], f1.c[1], f1.r2, f1.c[2]};
  for (unsigned j = 0; j < 4; ++j) EXPECT_LT(qeltest::relativeError(got[j], ref[1][j]), 1e-10) << j;
  for (unsigned degree : {2u, 3u}) {
    const Fit f = fit(x, y, degree);
    ASSERT_EQ(f.code, qel::qelOk);
    for (unsigned j = 0; j < 3; ++j)
      EXPECT_LT(qeltest::relativeError(f.c[j], ref[2][j]), 1e-5) << degree << " " << j;
    EXPECT_TRUE(degree == 2 || std::isnan(f.c[3]));
    EXPECT_LT(qeltest::relativeError(f.c[degree + 1], ref[2][4]), 1e-5);
    EXPECT_LT(qeltest::relativeError(f.r2, ref[2][3]), 1e-7);
    for (std::size_t i = 0; i < x.size(); ++i)
      EXPECT_LT(qeltest::relativeError(f.c[0] + x[i] * (f.c[1] + x[i] * f.c[2]), fitted2[i]), 1e-5)
          << degree << " " << i;
  }
}

TEST(CurveFit, EdgeCases) {
  std::vector<double> x, y;
  makeData(60, 3, 5.0, 0.5, &x, &y);
  const Fit standard = fit(x, y, 3, true, 1e-12);
  for (double tolerance : {0.0, -1.0, kNaN})
    EXPECT_EQ(std::memcmp(fit(x, y, 3, true, tolerance).c.data(), standard.c.data(), 40), 0);
  // Degree 0 gives the mean; a constant x fails the slope alone.
  const double mean = std::accumulate(y.begin(), y.end(), 0.0) / 60.0;
  EXPECT_NEAR(fit(x, y, 0).c[0], mean, 1e-15);
  const Fit constant = fit(std::vector<double>(60, 0.75), y, 2);
  EXPECT_TRUE(constant.code == qel::qelOk && close(constant.c[0], mean, 1e-15) &&
              std::isnan(constant.c[1]) && std::isnan(constant.c[2]) && constant.r2 == 0.0);
  // More terms than points: the trailing ones fail (R's lm: NA).
  const Fit few = fit({1.0, 3.0}, {2.0, 6.0}, 3);
  EXPECT_TRUE(few.code == qel::qelOk && close(few.c[0], 0.0, 1e-14) && close(few.c[1], 2.0, 1e-14));
  EXPECT_TRUE(std::isnan(few.c[2]) && std::isnan(few.c[3]) && std::isnan(few.c[4]));
  // Every pivot failing, no term, no row, or data that are not finite: 30019.
  const std::vector<double> zeros(5, 0.0), ys = {1, 2, 3, 4, 5}, bad = {1, 2, kNaN, 4, 5},
                                           huge = {1, 2, 3, 4, 1e80};  // x^5 overflows
  for (const Fit& f : {fit(zeros, ys, 2, false), fit(ys, ys, 0, false), fit({}, {}, 1),
                       fit(bad, ys, 1), fit(ys, bad, 1), fit(huge, ys, 5),
                       fit(ys, ys, 1, true, std::numeric_limits<double>::infinity())})
    EXPECT_TRUE(f.code == qel::qelFailSingular && allNaN(f));
}

// Scaling x and y by powers of 2 far beyond the range of their squares
// scales the coefficients exactly: the reduction must rescale the columns.
TEST(CurveFit, ExtremeMagnitudesScaleExactly) {
  std::vector<double> x, y;
  makeData(300, 4, 9.0, 0.5, &x, &y);
  const Fit plain = fit(x, y, 4);
  for (int ex : {-100, 100}) {
    for (int ey : {-600, 500}) {
      std::vector<double> xs = x, ys = y;
      for (double& v : xs) v = std::ldexp(v, ex);
      for (double& v : ys) v = std::ldexp(v, ey);
      const Fit f = fit(xs, ys, 4);
      for (int j = 0; j <= 5; ++j)  // sigma scales with y alone
        EXPECT_LT(qeltest::relativeError(std::ldexp(f.c[j], (j % 5) * ex - ey), plain.c[j]), 1e-12)
            << ex << " " << ey << " " << j;
      EXPECT_NEAR(f.r2, plain.r2, 1e-14);
    }
  }
}

TEST(CurveFit, HouseholderKernels) {
  // The reflection maps v onto r e_1 for either sign of v[0], and for
  // magnitudes whose squares overflow or underflow.
  for (double scale : {1.0, 1e-200, 1e200}) {
    for (double head : {3.0, -3.0, 1e-9}) {
      double v[4] = {head * scale, scale, -2.0 * scale, 2.0 * scale}, c[4], beta = 0.0;
      std::copy(v, v + 4, c);
      const double r = ex::GenerateHouseholderVector(v, 4, &beta);
      const double norm = std::sqrt(head * head + 9.0) * scale;
      EXPECT_LT(qeltest::relativeError(r, norm), 1e-15) << scale << " " << head;
      ex::HouseholderTransform(c, v, beta, 4);
      EXPECT_LT(qeltest::relativeError(c[0], norm), 1e-15);
      EXPECT_LE(std::fabs(c[1]) + std::fabs(c[2]) + std::fabs(c[3]), 3e-15 * norm);
    }
  }
  double single[1] = {-4.0}, beta = 1.0;
  EXPECT_TRUE(ex::GenerateHouseholderVector(single, 1, &beta) == -4.0 && beta == 0.0);
  // Upper triangle packed by columns: [2 1 -1; 0 4 2; 0 0 5] x = (3, 14, 10).
  const double packed[6] = {2, 1, 4, -1, 2, 5}, rhs[3] = {3, 14, 10};
  double solution[3];
  ex::SolveUpperTriangularSystem(solution, packed, 3, rhs);
  EXPECT_TRUE(solution[0] == 1.25 && solution[1] == 2.5 && solution[2] == 2.0);
}

TEST(CurveFit, Designs) {
  const unsigned sizes[3] = {2, 3, 1};  // one-way: constant, indicators, response
  int status = -1;
  double** one = ex::MakeDesignMatrix(sizes, 3, &status);
  ASSERT_EQ(status, qel::qelOk);
  const double expected[4][6] = {
      {1, 1, 1, 1, 1, 1}, {0, 0, 1, 1, 1, 0}, {0, 0, 0, 0, 0, 1}, {0, 0, 0, 0, 0, 0}};
  for (int k = 0; k < 4; ++k)
    for (int i = 0; i < 6; ++i) EXPECT_EQ(one[k][i], expected[k][i]) << k << " " << i;
  ex::DeleteAugmentedDesignMatrix(&one, 4);
  EXPECT_EQ(one, nullptr);
  // The polynomial design, with 1 and with 4 threads: the same doubles.
  std::vector<double> x, y;
  makeData(10007, 5, 3.0, 0.5, &x, &y);
  const int threads = omp_get_max_threads();
  double** designs[2] = {nullptr, nullptr};
  for (int t = 0; t < 2; ++t) {
    omp_set_num_threads(t == 0 ? 1 : 4);
    designs[t] = ex::MakeNAryAugmentedDesignMatrix(x.data(), y.data(), 10007, 5, &status, true);
    ASSERT_EQ(status, qel::qelOk);
  }
  omp_set_num_threads(threads);
  for (int k = 0; k < 7; ++k)
    EXPECT_EQ(std::memcmp(designs[0][k], designs[1][k], 10007 * sizeof(double)), 0) << k;
  EXPECT_TRUE(designs[0][0][17] == 1.0 && designs[0][3][17] == x[17] * x[17] * x[17] &&
              designs[0][6][17] == y[17]);
  for (auto& d : designs) ex::DeleteAugmentedDesignMatrix(&d, 7);
}

}  // namespace
