// Studentized range beside Rmath's ptukey/qtukey, same points, same run.
#include <Rmath.h>
#include <benchmark/benchmark.h>
#include <qel/distributions.h>

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
BENCHMARK(Qel_StudentizedRangeCritValue)->Unit(benchmark::kMicrosecond);
BENCHMARK(Rmath_StudentizedRangeCritValue)->Unit(benchmark::kMicrosecond);
