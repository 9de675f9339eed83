// Studentized range beside Rmath's ptukey/qtukey, same points, same run.
#include <Rmath.h>
#include <benchmark/benchmark.h>
#include <qel/distributions.h>

#include <cmath>

namespace {

void Qel_StudentizedRangePValue(benchmark::State& s) {
  double q = 3.0;
  for (auto _ : s) {
    benchmark::DoNotOptimize(qel::GetStudentizedRangePValue(q, 5, 20.0));
    q = q == 3.0 ? 3.01 : 3.0;
  }
}
void Rmath_StudentizedRangePValue(benchmark::State& s) {
  double q = 3.0;
  for (auto _ : s) {
    benchmark::DoNotOptimize(ptukey(q, 1.0, 5.0, 20.0, 0, 0));
    q = q == 3.0 ? 3.01 : 3.0;
  }
}
// k = 100, df = 1000 at P = 0.001, and the far tail at df = 1 (ptukey
// refuses df < 2: its nearest is df = 2).
void Qel_StudentizedRangePValueK100(benchmark::State& s) {
  for (auto _ : s) benchmark::DoNotOptimize(qel::GetStudentizedRangePValue(7.36, 100, 1000.0));
}
void Rmath_StudentizedRangePValueK100(benchmark::State& s) {
  for (auto _ : s) benchmark::DoNotOptimize(ptukey(7.36, 1.0, 100.0, 1000.0, 0, 0));
}
void Qel_StudentizedRangePValueFarTail(benchmark::State& s) {
  for (auto _ : s) benchmark::DoNotOptimize(qel::GetStudentizedRangePValue(1e300, 3, 1.0));
}
void Rmath_StudentizedRangePValueFarTailDf2(benchmark::State& s) {
  for (auto _ : s) benchmark::DoNotOptimize(ptukey(1e6, 1.0, 3.0, 2.0, 0, 0));
}
// The normal range (df infinite), k = 5.
void Qel_NormalRangePValue(benchmark::State& s) {
  for (auto _ : s) benchmark::DoNotOptimize(qel::v0::NormalRangeCdf(3.0, 5, true));
}
void Rmath_NormalRangePValue(benchmark::State& s) {
  for (auto _ : s) benchmark::DoNotOptimize(ptukey(3.0, 1.0, 5.0, INFINITY, 0, 0));
}
// A level off the table, so the critical value is searched.
void Qel_StudentizedRangeCritValue(benchmark::State& s) {
  for (auto _ : s) benchmark::DoNotOptimize(qel::GetStudentizedRangeCritValue(0.01, 5, 20.0));
}
void Rmath_StudentizedRangeCritValue(benchmark::State& s) {
  for (auto _ : s) benchmark::DoNotOptimize(qtukey(0.99, 1.0, 5.0, 20.0, 1, 0));
}

}  // namespace

BENCHMARK(Qel_StudentizedRangePValue)->Unit(benchmark::kMicrosecond);
BENCHMARK(Rmath_StudentizedRangePValue)->Unit(benchmark::kMicrosecond);
BENCHMARK(Qel_StudentizedRangePValueK100)->Unit(benchmark::kMicrosecond);
BENCHMARK(Rmath_StudentizedRangePValueK100)->Unit(benchmark::kMicrosecond);
BENCHMARK(Qel_StudentizedRangePValueFarTail)->Unit(benchmark::kMicrosecond);
BENCHMARK(Rmath_StudentizedRangePValueFarTailDf2)->Unit(benchmark::kMicrosecond);
BENCHMARK(Qel_NormalRangePValue)->Unit(benchmark::kMicrosecond);
BENCHMARK(Rmath_NormalRangePValue)->Unit(benchmark::kMicrosecond);
BENCHMARK(Qel_StudentizedRangeCritValue)->Unit(benchmark::kMicrosecond);
BENCHMARK(Rmath_StudentizedRangeCritValue)->Unit(benchmark::kMicrosecond);
