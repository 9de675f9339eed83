// Gauss-Legendre and Gauss-Laguerre weights for n = 16 to 1024 by libqel's
// Golub-Welsch (implicit QL on the Jacobi matrix, first components only),
// against Eigen 3.4's SelfAdjointEigenSolver::computeFromTridiagonal with
// eigenvectors (the same method with the whole eigenvector matrix), one
// thread, in the same run.
#include <benchmark/benchmark.h>

#include <Eigen/Dense>
#include <cmath>
#include <vector>

#include "utilities/MathUtilities.h"

namespace {

void QelGaussLegendreWeights(benchmark::State& state) {
  const auto n = static_cast<unsigned>(state.range(0));
  std::vector<double> x, w;
  for (auto _ : state) {
    qel::mGaussianQuadratureWeights(n, x, w);
    benchmark::DoNotOptimize(w.data());
  }
}
BENCHMARK(QelGaussLegendreWeights)
    ->RangeMultiplier(4)
    ->Range(16, 1024)
    ->Unit(benchmark::kMicrosecond);

void QelGaussLaguerreWeights(benchmark::State& state) {
  const auto n = static_cast<unsigned>(state.range(0));
  std::vector<double> x, w;
  for (auto _ : state) {
    qel::mGaussLaguerreQuadratureWeights(n, x, w, 0.5);
    benchmark::DoNotOptimize(w.data());
  }
}
BENCHMARK(QelGaussLaguerreWeights)
    ->RangeMultiplier(4)
    ->Range(16, 1024)
    ->Unit(benchmark::kMicrosecond);

void EigenGaussLegendreWeights(benchmark::State& state) {
  const auto n = static_cast<Eigen::Index>(state.range(0));
  Eigen::VectorXd diagonal = Eigen::VectorXd::Zero(n), off(n - 1);
  for (Eigen::Index i = 0; i + 1 < n; ++i) {
    const double k = static_cast<double>(i + 1);
    off[i] = 0.5 / std::sqrt(1.0 - 1.0 / (4.0 * k * k));
  }
  Eigen::SelfAdjointEigenSolver<Eigen::MatrixXd> solver;
  Eigen::VectorXd weights(n);
  for (auto _ : state) {
    solver.computeFromTridiagonal(diagonal, off, Eigen::ComputeEigenvectors);
    weights = 2.0 * solver.eigenvectors().row(0).transpose().array().square();
    benchmark::DoNotOptimize(weights.data());
  }
}
BENCHMARK(EigenGaussLegendreWeights)
    ->RangeMultiplier(4)
    ->Range(16, 1024)
    ->Unit(benchmark::kMicrosecond);

}  // namespace
