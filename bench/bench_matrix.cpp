// The value matrices against Eigen 3.4 in the same binary, one thread, on the
// same symmetric positive definite matrices (n = 100 and 500): LU with a
// solve, Cholesky, the symmetric eigensystem with vectors, the inverse and
// the product. Eigen is a benchmark peer only.
#define EIGEN_DONT_PARALLELIZE
#include <benchmark/benchmark.h>

#include <Eigen/Dense>
#include <cstdint>
#include <vector>

#include "utilities/MatrixLibrary/matrix_functions.h"
#include "utilities/MatrixLibrary/matrix_ludecomposition.h"

namespace {

using namespace qel::matrix_library;

// B'B/n + I for a pseudo-random B: symmetric, positive definite, cond ~ 10.
Mat spd(int n) {
  std::uint32_t seed = 12345;
  Mat b(n, n, 0.0);
  for (int i = 0; i < n; ++i)
    for (int j = 0; j < n; ++j) {
      seed = 1664525u * seed + 1013904223u;
      b(i, j) = (seed >> 8) * 0x1p-24 - 0.5;
    }
  Mat a;
  multiplyLeftTranspose(b, b, a);
  a *= 1.0 / n;
  for (int i = 0; i < n; ++i) a(i, i) += 1.0;
  return a;
}

Eigen::MatrixXd toEigen(const Mat& a) {
  Eigen::MatrixXd e(a.rowCount(), a.colCount());
  for (int i = 0; i < a.rowCount(); ++i)
    for (int j = 0; j < a.colCount(); ++j) e(i, j) = a(i, j);
  return e;
}

void QelLuSolve(benchmark::State& state) {
  const Mat a = spd(static_cast<int>(state.range(0)));
  const Vec b(static_cast<std::size_t>(a.rowCount()), 1.0);
  Vec x;
  for (auto _ : state) {
    LUDecomposition(a).Solve(b, &x);
    benchmark::DoNotOptimize(x.data());
  }
}
void EigenLuSolve(benchmark::State& state) {
  const Eigen::MatrixXd a = toEigen(spd(static_cast<int>(state.range(0))));
  const Eigen::VectorXd b = Eigen::VectorXd::Ones(a.rows());
  for (auto _ : state) {
    Eigen::VectorXd x = a.partialPivLu().solve(b);
    benchmark::DoNotOptimize(x.data());
  }
}

void QelCholesky(benchmark::State& state) {
  const SMat a = spd(static_cast<int>(state.range(0))).ConvertToSmatrix();
  UMat u;
  for (auto _ : state) {
    CholeskyDecomp(a, &u);
    benchmark::DoNotOptimize(u.storage().data());
  }
}
void EigenCholesky(benchmark::State& state) {
  const Eigen::MatrixXd a = toEigen(spd(static_cast<int>(state.range(0))));
  for (auto _ : state) {
    Eigen::LLT<Eigen::MatrixXd> llt(a);
    benchmark::DoNotOptimize(llt.matrixLLT().data());
  }
}

void QelEigenSystem(benchmark::State& state) {
  const Mat a = spd(static_cast<int>(state.range(0)));
  Vec values;
  Mat vectors;
  for (auto _ : state) {
    EigenSystems(a, values, vectors);
    benchmark::DoNotOptimize(vectors.data());
  }
}
void EigenEigenSystem(benchmark::State& state) {
  const Eigen::MatrixXd a = toEigen(spd(static_cast<int>(state.range(0))));
  for (auto _ : state) {
    Eigen::SelfAdjointEigenSolver<Eigen::MatrixXd> solver(a, Eigen::ComputeEigenvectors);
    benchmark::DoNotOptimize(solver.eigenvectors().data());
  }
}

void QelInverse(benchmark::State& state) {
  const Mat a = spd(static_cast<int>(state.range(0)));
  Mat inv;
  for (auto _ : state) {
    inverse(a, &inv);
    benchmark::DoNotOptimize(inv.data());
  }
}
void QelCholeskyInverse(benchmark::State& state) {
  const SMat a = spd(static_cast<int>(state.range(0))).ConvertToSmatrix();
  SMat inv;
  for (auto _ : state) {
    inverse(a, &inv);
    benchmark::DoNotOptimize(inv.storage().data());
  }
}
void EigenInverse(benchmark::State& state) {
  const Eigen::MatrixXd a = toEigen(spd(static_cast<int>(state.range(0))));
  for (auto _ : state) {
    Eigen::MatrixXd inv = a.inverse();
    benchmark::DoNotOptimize(inv.data());
  }
}

void QelProduct(benchmark::State& state) {
  const Mat a = spd(static_cast<int>(state.range(0)));
  for (auto _ : state) {
    Mat c = a * a;
    benchmark::DoNotOptimize(c.data());
  }
}
void EigenProduct(benchmark::State& state) {
  const Eigen::MatrixXd a = toEigen(spd(static_cast<int>(state.range(0))));
  for (auto _ : state) {
    Eigen::MatrixXd c = a * a;
    benchmark::DoNotOptimize(c.data());
  }
}

#define QEL_MATRIX_BENCH(fn) \
  BENCHMARK(fn)->Arg(100)->Arg(500)->Unit(benchmark::kMillisecond)->MinTime(0.2)
QEL_MATRIX_BENCH(QelLuSolve);
QEL_MATRIX_BENCH(EigenLuSolve);
QEL_MATRIX_BENCH(QelCholesky);
QEL_MATRIX_BENCH(EigenCholesky);
QEL_MATRIX_BENCH(QelEigenSystem);
QEL_MATRIX_BENCH(EigenEigenSystem);
QEL_MATRIX_BENCH(QelInverse);
QEL_MATRIX_BENCH(QelCholeskyInverse);
QEL_MATRIX_BENCH(EigenInverse);
QEL_MATRIX_BENCH(QelProduct);
QEL_MATRIX_BENCH(EigenProduct);

}  // namespace
