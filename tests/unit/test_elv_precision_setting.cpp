// The precision setting of the ELV routines: the scaled series of every
// family take the number of terms their cut-off asks for, under the
// historical setting (1e-9) and at double precision, against lengths
// counted from the published term ratios (tests/data/elv_series_lengths.csv,
// tools/reference/gen_elv_series_lengths.py); the setting is restored by its
// scope.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include "reference_data.h"
#include "utilities/elv/precision.h"

namespace {

using qel::elv::ElvPrecision;

int runHelper(const std::string& helper, const double* a) {
  double out = 0.0;
  if (helper == "gamma_Iax") return gamma_Iax(&out, a[0], a[1]);
  if (helper == "poisson_Ik") return poisson_Ik(static_cast<long>(a[0]), &out, a[1]);
  if (helper == "binomial_Ik") {
    return binomial_Ik(static_cast<long>(a[0]), static_cast<long>(a[1]), &out, a[2]);
  }
  return hyper_Ik(static_cast<unsigned long>(a[0]), static_cast<unsigned long>(a[1]),
                  static_cast<unsigned long>(a[2]), static_cast<unsigned long>(a[3]), &out);
}

TEST(ElvPrecisionSetting, SeriesLengthsOfBothSettings) {
  int rows = 0;
  for (const auto& row : qeltest::loadReferenceData("elv_series_lengths.csv", 2)) {
    const bool historical = row.text[1] == "historical";
    const qel::elv::ScopedElvPrecision scope(historical ? ElvPrecision::Historical
                                                        : ElvPrecision::Full);
    ELVerrno = 0;
    EXPECT_EQ(runHelper(row.text[0], row.numbers.data()), 0) << "line " << row.line;
    EXPECT_EQ(ELVsteps1, static_cast<int64_t>(row.numbers[4]))
        << row.text[0] << " line " << row.line;
    ++rows;
  }
  EXPECT_GT(rows, 30);
}

TEST(ElvPrecisionSetting, ScopeRestoresTheSetting) {
  EXPECT_EQ(qel::elv::elvPrecision(), ElvPrecision::Full);
  {
    const qel::elv::ScopedElvPrecision outer(ElvPrecision::Historical);
    EXPECT_EQ(qel::elv::seriesCutoff(), 1e-9);
    EXPECT_EQ(qel::elv::mixtureStop(), 5e-10);
    const qel::elv::ScopedElvPrecision inner(ElvPrecision::Full);
    EXPECT_LT(qel::elv::seriesCutoff(), 1e-16);
  }
  EXPECT_EQ(qel::elv::elvPrecision(), ElvPrecision::Full);
}

}  // namespace
