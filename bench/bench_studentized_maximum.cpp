// Studentized maximum and maximum modulus P-values and critical values.
// No peer: R base has no such function (package mvtnorm is not installed
// here); the studentized range P-value of the same run gives the scale.
#include <benchmark/benchmark.h>
#include <qel/distributions.h>

#include <cmath>
#include <vector>

namespace {

const std::vector<double> kTen{0.1, 0.2, 0.3, 0.4, 0.5, 0.6, 0.7, 0.8, 0.85, 0.9};
const std::vector<double> kControl(4, std::sqrt(0.5));  // four comparisons with one control

void modulusPValue(benchmark::State& s, const std::vector<double>& l, double df) {
  double x = 3.0;
  for (auto _ : s) {
    benchmark::DoNotOptimize(qel::GetStudentizedMaximumModulusPValue(x, df, l.data(), l.size()));
    x = x == 3.0 ? 3.01 : 3.0;
  }
}
void Qel_MaxModulusPValue_TenDistinct_df20(benchmark::State& s) {
  modulusPValue(s, kTen, 20.0);
}
void Qel_MaxModulusPValue_TenDistinct_dfInf(benchmark::State& s) {
  modulusPValue(s, kTen, INFINITY);
}
void Qel_MaxModulusPValue_Control4_df20(benchmark::State& s) {
  modulusPValue(s, kControl, 20.0);
}
void Qel_MaximumPValue_Control4_df20(benchmark::State& s) {
  double x = 2.5;
  for (auto _ : s) {
    benchmark::DoNotOptimize(
        qel::GetStudentizedMaximumPValue(x, 20.0, kControl.data(), kControl.size()));
    x = x == 2.5 ? 2.51 : 2.5;
  }
}
void Qel_MaxModulusCritValue_Control4_df20(benchmark::State& s) {
  for (auto _ : s)
    benchmark::DoNotOptimize(
        qel::GetStudentizedMaximumModulusCritValue(0.05, 20.0, kControl.data(), kControl.size()));
}
void Qel_StudentizedRangePValue_k5_df20(benchmark::State& s) {
  double q = 3.0;
  for (auto _ : s) {
    benchmark::DoNotOptimize(qel::GetStudentizedRangePValue(q, 5, 20.0));
    q = q == 3.0 ? 3.01 : 3.0;
  }
}

}  // namespace

BENCHMARK(Qel_MaxModulusPValue_TenDistinct_df20)->Unit(benchmark::kMicrosecond);
BENCHMARK(Qel_MaxModulusPValue_TenDistinct_dfInf)->Unit(benchmark::kMicrosecond);
BENCHMARK(Qel_MaxModulusPValue_Control4_df20)->Unit(benchmark::kMicrosecond);
BENCHMARK(Qel_MaximumPValue_Control4_df20)->Unit(benchmark::kMicrosecond);
BENCHMARK(Qel_MaxModulusCritValue_Control4_df20)->Unit(benchmark::kMicrosecond);
BENCHMARK(Qel_StudentizedRangePValue_k5_df20)->Unit(benchmark::kMicrosecond);
