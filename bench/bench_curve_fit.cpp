// The cubic curve fit against Eigen 3.4's HouseholderQR in the same binary,
// one thread, on the same points (n = 1e5 and 1e6): the whole fit from x and
// y (the design built, reduced and solved, with R^2), and the least squares
// on a design already built (both sides copy it first: Eigen's HouseholderQR
// copies its argument). The whole fit is also run with all threads (the
// design's power columns are filled in parallel). Eigen is a benchmark peer
// only.
#define EIGEN_DONT_PARALLELIZE
#include <benchmark/benchmark.h>
#include <omp.h>
#include <qel/curve_fit.h>

#include <Eigen/Dense>
#include <algorithm>
#include <cstdint>
#include <vector>

#include "interfaces/linear_modelling/utilities.h"

namespace {

namespace ex = qel::v1::experimental;
constexpr unsigned kDegree = 3;

struct Points {
  std::vector<double> x, y;
};

// x uniform on [-2, 2), y a cubic plus uniform noise.
const Points& points(std::size_t n) {
  static std::vector<Points> cache(2);
  Points& p = cache[n > 100000 ? 1 : 0];
  if (p.x.size() == n) return p;
  std::uint32_t seed = 20261123u;
  auto uniform = [&seed] {
    seed = 1664525u * seed + 1013904223u;
    return (seed >> 8) * 0x1p-24;
  };
  p.x.resize(n);
  p.y.resize(n);
  for (std::size_t i = 0; i < n; ++i) {
    const double x = 4.0 * uniform() - 2.0;
    p.x[i] = x;
    p.y[i] = 1.5 + x * (-0.75 + x * (0.25 + 0.5 * x)) + (uniform() - 0.5);
  }
  return p;
}

void QelCurveFitCubic(benchmark::State& state, int threads) {
  const Points& p = points(static_cast<std::size_t>(state.range(0)));
  const int saved = omp_get_max_threads();
  omp_set_num_threads(threads > 0 ? threads : omp_get_num_procs());
  double c[kDegree + 2], r2 = 0.0;
  for (auto _ : state) {
    qel::v1::RunLynGrCurveFit(c, &r2, p.x.data(), p.y.data(), static_cast<unsigned>(p.x.size()),
                              kDegree, 0.0, true);
    benchmark::DoNotOptimize(c);
  }
  omp_set_num_threads(saved);
  state.counters["r2"] = r2;
}
void BM_QelCurveFitCubic(benchmark::State& state) {
  QelCurveFitCubic(state, 1);
}
void BM_QelCurveFitCubicAllThreads(benchmark::State& state) {
  QelCurveFitCubic(state, 0);
}

// Eigen on the same work: the design, HouseholderQR, the solve and R^2.
void BM_EigenCurveFitCubic(benchmark::State& state) {
  const Points& p = points(static_cast<std::size_t>(state.range(0)));
  const Eigen::Index n = static_cast<Eigen::Index>(p.x.size());
  const Eigen::Map<const Eigen::VectorXd> x(p.x.data(), n), y(p.y.data(), n);
  double r2 = 0.0;
  for (auto _ : state) {
    Eigen::MatrixXd design(n, kDegree + 1);
    design.col(0).setOnes();
    design.col(1) = x;
    for (unsigned k = 2; k <= kDegree; ++k) design.col(k) = design.col(k - 1).cwiseProduct(x);
    const Eigen::HouseholderQR<Eigen::MatrixXd> qr(design);
    const Eigen::VectorXd beta = qr.solve(y);
    const double rss = (y - design * beta).squaredNorm();
    r2 = 1.0 - rss / (y.array() - y.mean()).square().sum();
    benchmark::DoNotOptimize(beta.data());
  }
  state.counters["r2"] = r2;
}

// The least squares alone, on a design built beforehand.
void BM_QelLeastSquaresOnDesign(benchmark::State& state) {
  const Points& p = points(static_cast<std::size_t>(state.range(0)));
  const auto n = static_cast<unsigned>(p.x.size());
  omp_set_num_threads(1);
  int status = 0;
  double** built =
      ex::MakeNAryAugmentedDesignMatrix(p.x.data(), p.y.data(), n, kDegree, &status, true);
  double** work =
      ex::MakeNAryAugmentedDesignMatrix(p.x.data(), p.y.data(), n, kDegree, &status, true);
  const unsigned columns = ex::CurveFitDesignColumns(kDegree, true);
  double c[kDegree + 2], r2 = 0.0;
  for (auto _ : state) {
    for (unsigned k = 0; k < columns; ++k) std::copy(built[k], built[k] + n, work[k]);
    ex::RunLynGrCurveFit(c, &r2, work, n, kDegree, 0.0, true);
    benchmark::DoNotOptimize(c);
  }
  ex::DeleteAugmentedDesignMatrix(&built, columns);
  ex::DeleteAugmentedDesignMatrix(&work, columns);
}

void BM_EigenLeastSquaresOnDesign(benchmark::State& state) {
  const Points& p = points(static_cast<std::size_t>(state.range(0)));
  const Eigen::Index n = static_cast<Eigen::Index>(p.x.size());
  Eigen::MatrixXd design(n, kDegree + 1);
  const Eigen::Map<const Eigen::VectorXd> x(p.x.data(), n), y(p.y.data(), n);
  design.col(0).setOnes();
  design.col(1) = x;
  for (unsigned k = 2; k <= kDegree; ++k) design.col(k) = design.col(k - 1).cwiseProduct(x);
  for (auto _ : state) {
    const Eigen::HouseholderQR<Eigen::MatrixXd> qr(design);
    const Eigen::VectorXd beta = qr.solve(y);
    benchmark::DoNotOptimize(beta.data());
  }
}

#define QEL_CURVE_FIT_BENCHMARK(fn) \
  BENCHMARK(fn)->Arg(100000)->Arg(1000000)->Unit(benchmark::kMillisecond)->MinTime(0.3)
QEL_CURVE_FIT_BENCHMARK(BM_QelCurveFitCubic);
QEL_CURVE_FIT_BENCHMARK(BM_EigenCurveFitCubic);
QEL_CURVE_FIT_BENCHMARK(BM_QelCurveFitCubicAllThreads);
QEL_CURVE_FIT_BENCHMARK(BM_QelLeastSquaresOnDesign);
QEL_CURVE_FIT_BENCHMARK(BM_EigenLeastSquaresOnDesign);

}  // namespace
