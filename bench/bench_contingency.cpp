// IContingencyTable::Analyze with every result requested, on square tables
// of 2, 100 and 1000 levels, with one thread and with all threads. The peer
// numbers (R's chisq.test, SciPy's chi2_contingency and somersd on the same
// tables) come from bench/peer_contingency.R and bench/peer_contingency.py,
// which build the same tables with the same generator.
#include <benchmark/benchmark.h>
#include <omp.h>
#include <qel/contingency_table.h>

#include <cstdint>
#include <vector>

namespace {

// Counts 0 .. 20 from a linear congruential generator, column by column.
std::vector<double> table(unsigned n) {
  std::vector<double> v(static_cast<std::size_t>(n) * n);
  std::uint32_t seed = 12345;
  for (auto& e : v) {
    seed = 1664525u * seed + 1013904223u;
    e = static_cast<double>((seed >> 8) % 21);
  }
  return v;
}

struct Buffers {
  std::vector<double> cells, columnTotals, rowTotals, columnPct, rowPct, marks;
  double grand[1], pearson[3], lr[3], fisher[1], mcnemar[4], cramer[1], kappa[1], r[1], rho[1],
      gk[4], concordance[9], mhc[4];
  explicit Buffers(unsigned n)
      : cells(8 * static_cast<std::size_t>(n) * n),
        columnTotals(n),
        rowTotals(n),
        columnPct(n),
        rowPct(n),
        marks(n, 0.0) {}
};

void lend(qel::IContingencyTable* t, std::vector<double> const& counts, Buffers& b, unsigned n) {
  const std::size_t size = static_cast<std::size_t>(n) * n;
  for (unsigned c = 0; c < n; ++c) {
    t->SetupObservedCounts(counts.data() + c * n, c);
    double* at = b.cells.data() + c * n;
    t->SetupExpectedCounts(at, c);
    t->SetupRawResiduals(at + size, c);
    t->SetupStandardizedResiduals(at + 2 * size, c);
    t->SetupAdjustedResiduals(at + 3 * size, c);
    t->SetupChisquareContributions(at + 4 * size, c);
    t->SetupColumnPercentages(at + 5 * size, c);
    t->SetupRowPercentages(at + 6 * size, c);
    t->SetupPercentages(at + 7 * size, c);
  }
  t->SetupColumnTotals(b.columnTotals.data());
  t->SetupRowTotals(b.rowTotals.data());
  t->SetupColumnTotalPercentages(b.columnPct.data());
  t->SetupRowTotalPercentages(b.rowPct.data());
  t->SetupGrandTotal(b.grand);
  t->SetupPearsonChisquareTest(b.pearson);
  t->SetupLikelihoodRatioTest(b.lr);
  t->SetupFisherExactTest(b.fisher);
  t->SetupMcNemarTest(b.mcnemar);
  t->SetupCramerVSquare(b.cramer);
  t->SetupKappa(b.marks.data(), b.kappa, n);
  t->SetupPearsonR(b.r);
  t->SetupSpearmanRho(b.rho);
  t->SetupGoodmanKruskal(b.gk);
  t->SetupMeasuresOfConcordance(b.concordance);
  t->SetupMHCTest(b.mhc);
}

// range(0): levels of both margins; range(1): threads (0 = all).
void QelAnalyzeEverything(benchmark::State& state) {
  const auto n = static_cast<unsigned>(state.range(0));
  const int saved = omp_get_max_threads();
  if (state.range(1) > 0) omp_set_num_threads(static_cast<int>(state.range(1)));
  const std::vector<double> counts = table(n);
  Buffers buffers(n);
  int code = 0;
  qel::IContingencyTable* t = qel::MakeIContingencyTable(n, n, 0xFFFFFF, &code);
  lend(t, counts, buffers, n);
  for (auto _ : state) {
    benchmark::DoNotOptimize(t->Analyze());
    benchmark::DoNotOptimize(buffers.concordance[7]);
  }
  qel::DeleteIContingencyTable(&t);
  omp_set_num_threads(saved);
  state.SetItemsProcessed(state.iterations() * n * n);
}

BENCHMARK(QelAnalyzeEverything)
    ->ArgsProduct({{2, 100, 1000}, {1, 0}})
    ->ArgNames({"levels", "threads"})
    ->Unit(benchmark::kMicrosecond);

}  // namespace
