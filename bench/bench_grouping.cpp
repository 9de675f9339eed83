// Grouping of 1e7 rows: one column of 1000 distinct values (natural, first
// encountered, and defined order with a 100-value list), two columns of
// 100 x 1000 (only the occurring combinations, and all of them), and the
// group look-up of 1e6 rows. The peer is R (bench/peer_grouping.R: order()
// with run detection, and data.table), timed in the same session on the
// same columns, which this benchmark writes to a binary file for it.
#include <benchmark/benchmark.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <random>
#include <vector>

#include "proxies/grouping.h"

namespace {

constexpr std::size_t kRows = 10000000;

struct Columns {
  std::vector<double> thousand, hundred, list;
};

// The columns, made once; written (two doubles per row, row by row) for the
// R peer to read back.
const Columns& columns() {
  static const Columns made = [] {
    Columns c;
    std::mt19937_64 engine(20261123);
    c.thousand.resize(kRows);
    c.hundred.resize(kRows);
    for (std::size_t i = 0; i < kRows; ++i) {
      c.thousand[i] = static_cast<double>(engine() % 1000);
      c.hundred[i] = static_cast<double>(engine() % 100);
    }
    for (int v = 0; v < 100; ++v) c.list.push_back(static_cast<double>((v * 37) % 1000));
    const char* path = std::getenv("QEL_GROUPING_COLUMNS");
    if (FILE* out = std::fopen(path != nullptr ? path : "/tmp/qel_grouping_columns.bin", "wb")) {
      std::fwrite(c.hundred.data(), sizeof(double), kRows, out);
      std::fwrite(c.thousand.data(), sizeof(double), kRows, out);
      std::fclose(out);
    }
    return c;
  }();
  return made;
}

using Col = qel::CmColumnVar<double>;

void run(benchmark::State& state, std::vector<const Col*> cols, int order, bool all) {
  for (auto _ : state) {
    qel::CmGrouping<double> grouping;
    if (order == 0) grouping.mUseNaturalOrder();
    if (order == 1) grouping.mUseFirstEncounteredOrder();
    benchmark::DoNotOptimize(grouping.mFindGrouping(cols, false, all, true));
    state.counters["groups"] = grouping.mGetNumberOfGroups();
  }
}

void QelGroupOneColumnNatural(benchmark::State& state) {
  Col a(&columns().thousand, qel::eNaturalSortOrder);
  run(state, {&a}, 0, false);
}

void QelGroupOneColumnFirstEncountered(benchmark::State& state) {
  Col a(&columns().thousand, qel::eFirstEncounteredSortOrder);
  run(state, {&a}, 1, false);
}

void QelGroupOneColumnDefinedList100(benchmark::State& state) {
  Col a(&columns().thousand, qel::eNaturalSortOrder);
  a.mSetSortOrder(&columns().list);
  run(state, {&a}, 2, false);
}

void QelGroupTwoColumns(benchmark::State& state) {
  Col a(&columns().hundred, qel::eNaturalSortOrder), b(&columns().thousand, qel::eNaturalSortOrder);
  run(state, {&a, &b}, 0, state.range(0) != 0);
}

void QelGetGroup1e6Rows(benchmark::State& state) {
  Col a(&columns().hundred, qel::eNaturalSortOrder), b(&columns().thousand, qel::eNaturalSortOrder);
  qel::CmGrouping<double> grouping;
  grouping.mUseNaturalOrder();
  grouping.mFindGrouping({&a, &b}, false, false, true);
  for (auto _ : state) {
    long long sum = 0;
    for (int row = 1; row <= 1000000; ++row) sum += grouping.mGetGroup(row);
    benchmark::DoNotOptimize(sum);
  }
}

}  // namespace

BENCHMARK(QelGroupOneColumnNatural)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(QelGroupOneColumnFirstEncountered)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(QelGroupOneColumnDefinedList100)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(QelGroupTwoColumns)->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(QelGetGroup1e6Rows)->Unit(benchmark::kMillisecond)->Iterations(3);
