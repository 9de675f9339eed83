// The exported symmetric interval maker, linked from the shared library:
// rebuilds the limits of every row of location_tests.csv (mpmath) from its
// estimate, standard error and degrees of freedom, with the t quantile (and
// the normal one for the z test), for every interval type; a type outside
// -1, 0, 1 gives 30002 and NaN limits.
#include <gtest/gtest.h>
#include <qel/interval.h>

#include <cmath>
#include <utility>

#include "unit/reference_data.h"

namespace {

TEST(ExportedInterval, LimitsOfEveryLocationTestRow) {
  int rows = 0;
  for (const auto& row : qeltest::loadReferenceData("location_tests.csv", 3)) {
    const auto& v =
        row.numbers;  // confidence, type, ..., estimate, deviation, se, df, lower, upper
    const auto type = static_cast<qel::IntervalType>(static_cast<int>(v[1]));
    const double estimate = v[5], se = v[7], df = v[8];
    double lower = 0.0, upper = 0.0;
    const int code = row.text[0] == "z1"
                         ? qel::v1::MakeTraditionalSymmetricCI(qel::v0::NormalInvCdfFunc(), v[0],
                                                               type, estimate, se, &lower, &upper)
                         : qel::v1::MakeTraditionalSymmetricCI(qel::v0::TInvCdfFunc(df), v[0], type,
                                                               estimate, se, &lower, &upper);
    ASSERT_EQ(code, 0) << "line " << row.line;
    // Limits judged against the half-width they carry, as in the tests;
    // the open side of a one-sided interval is exactly infinite.
    for (const auto& [got, want] : {std::make_pair(lower, v[9]), std::make_pair(upper, v[10])}) {
      EXPECT_TRUE(std::isfinite(want) ? std::fabs(got - want) <= 3e-9 * se : got == want)
          << "line " << row.line << ": " << got << " vs " << want;
    }
    ++rows;
  }
  EXPECT_GT(rows, 150);
  double lower = 0.0, upper = 0.0;
  for (int bad : {2, -7}) {
    EXPECT_EQ(qel::v1::MakeTraditionalSymmetricCI(qel::v0::NormalInvCdfFunc(), 0.95,
                                                  static_cast<qel::IntervalType>(bad), 1.0, 1.0,
                                                  &lower, &upper),
              30002);
    EXPECT_TRUE(std::isnan(lower) && std::isnan(upper));
  }
  // A quantile that fails (NaN degrees of freedom) gives NaN limits, code 0.
  EXPECT_EQ(
      qel::v1::MakeTraditionalSymmetricCI(qel::v0::TInvCdfFunc(NAN), 0.95, qel::kIntervalLowerBound,
                                          10.0, 2.0, &lower, &upper),
      0);
  EXPECT_TRUE(std::isnan(lower) && upper == INFINITY);
}

}  // namespace
