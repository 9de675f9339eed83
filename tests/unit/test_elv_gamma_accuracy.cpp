// The gamma, Poisson and chi-square ELV routines against mpmath reference
// values (tools/reference/gen_elv_gamma.py), run inside the armed
// floating-point state so that any trap would surface as a failure.
//
// Status 0: each tail to 1e-8 relative error (the series cut-off is 1e-9).
// Status 1: the tail that underflowed is exactly 0 (the other exactly 1), and
// the reference confirms it is below the underflow limit. Quantiles: the
// probability at the computed point is within 1e-9 relative of the target.
// The largest error per routine is printed and recorded as a test property.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/elv.h>

#include <cmath>
#include <cstdio>
#include <map>
#include <sstream>
#include <stdexcept>
#include <string>

#include "reference_data.h"
#include "utilities/elv/wrappers.h"

namespace {

using qel::ElvStatus;
using qeltest::relativeError;

constexpr double kTailTolerance = 1e-8;
constexpr double kQuantileTolerance = 1e-9;
// e^-662.34472, with room for the rounding of the reference.
constexpr double kUnderflowValue = 1.5e-288;
// Arguments below this count as 0.
constexpr double kTinyArgument = 2.2250738585072014e-288;

// Largest error seen per routine, printed at the end of each test.
class ErrorReport {
 public:
  explicit ErrorReport(std::string test) : test_(std::move(test)) {}
  void add(const std::string& routine, double error, const std::string& where) {
    auto& entry = worst_[routine];
    ++entry.count;
    if (error > entry.error || entry.count == 1) {
      entry.error = error;
      entry.where = where;
    }
  }
  ~ErrorReport() {
    for (const auto& [routine, entry] : worst_) {
      std::printf("[ accuracy ] %-28s largest relative error %.3g over %d points (at %s)\n",
                  routine.c_str(), entry.error, entry.count, entry.where.c_str());
      char value[32];
      std::snprintf(value, sizeof value, "%.3g", entry.error);
      ::testing::Test::RecordProperty(test_ + "." + routine, value);
    }
  }

 private:
  struct Entry {
    double error = 0.0;
    int count = 0;
    std::string where;
  };
  std::string test_;
  std::map<std::string, Entry> worst_;
};

std::string describe(const qeltest::Row& row) {
  std::ostringstream s;
  s.precision(17);
  s << "line " << row.line << " (";
  for (const auto& t : row.text) s << t << ",";
  for (std::size_t i = 0; i < row.numbers.size() && i < 3; ++i)
    s << (i ? "," : "") << row.numbers[i];
  s << ")";
  return s.str();
}

// Runs a routine in the armed state; a trap (an exception) becomes status -1.
template <class Call>
int armed(Call call) {
  qel::SetLynFpuStates();
  int status;
  try {
    status = call();
  } catch (const std::exception&) {
    status = -1;
  }
  qel::ResetFpuStates();
  return status;
}

// Checks one pair of tails against the reference; reports both errors.
void checkTails(ErrorReport& report, const std::string& routine, int status, double lower,
                double upper, double refLower, double refUpper, const std::string& where,
                double underflowValue = kUnderflowValue) {
  if (status == 0) {
    const double errLower = relativeError(lower, refLower);
    const double errUpper = relativeError(upper, refUpper);
    report.add(routine + " lower", errLower, where);
    report.add(routine + " upper", errUpper, where);
    EXPECT_LE(errLower, kTailTolerance)
        << routine << " lower " << lower << " vs " << refLower << " at " << where;
    EXPECT_LE(errUpper, kTailTolerance)
        << routine << " upper " << upper << " vs " << refUpper << " at " << where;
  } else if (status == 1) {
    const bool lowerUnderflow = lower == 0.0 && upper == 1.0 && refLower < underflowValue;
    const bool upperUnderflow = upper == 0.0 && lower == 1.0 && refUpper < underflowValue;
    EXPECT_TRUE(lowerUnderflow || upperUnderflow)
        << routine << " status 1 with " << lower << ", " << upper << " (reference " << refLower
        << ", " << refUpper << ") at " << where;
  } else {
    ADD_FAILURE() << routine << " status " << status << " at " << where;
  }
}

TEST(ElvAccuracy, GammaTailsAndDensity) {
  ErrorReport report("gamma_df");
  const auto rows = qeltest::loadReferenceData("elv_gamma.csv", 0);
  ASSERT_GT(rows.size(), 700u);
  for (const auto& row : rows) {
    const double a = row.numbers[0], x = row.numbers[1];
    double lower = -1, upper = -1, density = -1;
    const int status =
        armed([&] { return static_cast<int>(qel::elv_gamma_df(x, a, &lower, &upper, &density)); });
    const std::string where = describe(row);
    if (x < kTinyArgument) {
      // An argument below the smallest admissible one counts as 0.
      EXPECT_EQ(status, 0) << where;
      EXPECT_EQ(lower, 0.0) << where;
      EXPECT_EQ(upper, 1.0) << where;
      continue;
    }
    checkTails(report, "gamma_df", status, lower, upper, row.numbers[2], row.numbers[3], where);
    const double refDensity = row.numbers[4];
    if (status <= 1) {
      if (refDensity > kUnderflowValue) {
        const double err = relativeError(density, refDensity);
        report.add("gamma_df density", err, where);
        EXPECT_LE(err, kTailTolerance) << "density at " << where;
      } else {
        EXPECT_EQ(density, 0.0) << "underflowed density at " << where;
      }
    }
    // The chi-square law is the same law at twice the argument and shape.
    if (2 * a <= 189812530.0 && 2 * x <= 189812530.0) {
      double cLower = -1, cUpper = -1, cDensity = -1;
      const int cStatus = armed([&] {
        return static_cast<int>(qel::elv_chi2_df(2 * x, 2 * a, &cLower, &cUpper, &cDensity));
      });
      checkTails(report, "chi2_df", cStatus, cLower, cUpper, row.numbers[2], row.numbers[3], where);
    }
  }
}

TEST(ElvAccuracy, PoissonTailsAndMass) {
  ErrorReport report("poisson_df");
  const auto rows = qeltest::loadReferenceData("elv_poisson.csv", 0);
  ASSERT_GT(rows.size(), 250u);
  for (const auto& row : rows) {
    const auto k = static_cast<unsigned long>(row.numbers[0]);
    const double m = row.numbers[1];
    double lower = -1, upper = -1, mass = -1;
    const int status =
        armed([&] { return static_cast<int>(qel::elv_poisson_df(k, m, &lower, &upper, &mass)); });
    const std::string where = describe(row);
    checkTails(report, "poisson_df", status, lower, upper, row.numbers[2], row.numbers[3], where);
    const double refMass = row.numbers[4];
    if (status <= 1) {
      if (refMass > kUnderflowValue) {
        const double err = relativeError(mass, refMass);
        report.add("poisson_df mass", err, where);
        EXPECT_LE(err, kTailTolerance) << "mass at " << where;
      } else {
        EXPECT_EQ(mass, 0.0) << "underflowed mass at " << where;
      }
    }
  }
}

TEST(ElvAccuracy, NoncentralChiSquareTails) {
  ErrorReport report("chi2_ncdf");
  const auto rows = qeltest::loadReferenceData("elv_ncchi2.csv", 0);
  ASSERT_GT(rows.size(), 500u);
  for (const auto& row : rows) {
    const double x = row.numbers[0], df = row.numbers[1], L = row.numbers[2];
    double lower = -1, upper = -1;
    const int status =
        armed([&] { return static_cast<int>(qel::elv_chi2_ncdf(x, df, L, &lower, &upper)); });
    // An underflowing peak term leaves a sum of at most a few thousand such
    // terms below the limit.
    checkTails(report, "chi2_ncdf", status, lower, upper, row.numbers[3], row.numbers[4],
               describe(row), 1e-280);
    // The gamma form at half the arguments is the same law.
    double gLower = -1, gUpper = -1;
    const int gStatus = armed([&] {
      return static_cast<int>(qel::elv_gamma_ncdf(x / 2, df / 2, L / 2, &gLower, &gUpper));
    });
    EXPECT_EQ(gStatus, status) << describe(row);
  }
}

// Gamma and chi-square quantiles: a relative error e of the point moves the
// probability by e times the sensitivity q f(q)/p.
void checkGammaQuantile(ErrorReport& report, const std::string& routine, int status, double q,
                        double expected, double sensitivity, const std::string& where) {
  if (status == 0) {
    const double err = relativeError(q, expected) * sensitivity;
    report.add(routine, err, where);
    EXPECT_LE(err, kQuantileTolerance)
        << routine << " " << q << " vs " << expected << " at " << where;
  } else if (status == 1) {
    EXPECT_EQ(q, 0.0) << routine << " status 1 at " << where;
    EXPECT_LT(expected, 1e-280) << routine << " status 1 at " << where;
  } else {
    ADD_FAILURE() << routine << " status " << status << " at " << where;
  }
}

TEST(ElvAccuracy, GammaAndChiSquareQuantilesInvert) {
  ErrorReport report("quantiles");
  const auto rows = qeltest::loadReferenceData("elv_quantiles.csv", 1);
  int gammaRows = 0;
  for (const auto& row : rows) {
    const std::string& kind = row.text[0];
    if (kind != "gamma_lower" && kind != "gamma_upper") continue;
    ++gammaRows;
    const bool upper = kind == "gamma_upper";
    const double p = row.numbers[0], a = row.numbers[1], expected = row.numbers[2],
                 sensitivity = row.numbers[3];
    double q = -1, c = -1;
    const int status = armed([&] {
      return static_cast<int>(upper ? qel::elv_gamma_upper_quant(p, a, &q)
                                    : qel::elv_gamma_lower_quant(p, a, &q));
    });
    const int cStatus = armed([&] {
      return static_cast<int>(upper ? qel::elv_chi2_upper_quant(p, 2 * a, &c)
                                    : qel::elv_chi2_lower_quant(p, 2 * a, &c));
    });
    // Beyond a shape of 10000 the Cornish-Fisher expansion stands without
    // Newton steps; its error is reported under a name of its own.
    const std::string suffix = a > 10000.0 ? " (Cornish-Fisher)" : "";
    const std::string where = describe(row);
    if (suffix.empty()) {
      checkGammaQuantile(report, kind + "_quant", status, q, expected, sensitivity, where);
      checkGammaQuantile(report, std::string(upper ? "chi2_upper" : "chi2_lower") + "_quant",
                         cStatus, c, 2 * expected, sensitivity, where);
    } else {
      ASSERT_EQ(status, 0) << where;
      const double err = relativeError(q, expected) * sensitivity;
      report.add(kind + "_quant" + suffix, err, where);
      EXPECT_LE(err, 1e-8) << where;
    }
  }
  EXPECT_GT(gammaRows, 200);
}

TEST(ElvAccuracy, PoissonQuantiles) {
  ErrorReport report("poisson_quant");
  const auto rows = qeltest::loadReferenceData("elv_quantiles.csv", 1);
  int poissonRows = 0;
  for (const auto& row : rows) {
    const std::string& kind = row.text[0];
    if (kind != "poisson_lower" && kind != "poisson_upper") continue;
    ++poissonRows;
    const double p = row.numbers[0], m = row.numbers[1];
    const auto expectedK = static_cast<unsigned long>(row.numbers[2]);
    const double massOverP = row.numbers[3], expectedF = row.numbers[4];
    unsigned long k = 0;
    double f = -1;
    const int status = armed([&] {
      return static_cast<int>(kind == "poisson_upper" ? qel::elv_poisson_upper_quant(p, m, &k, &f)
                                                      : qel::elv_poisson_lower_quant(p, m, &k, &f));
    });
    const std::string where = describe(row);
    ASSERT_EQ(status, 0) << kind << " at " << where;
    EXPECT_EQ(k, expectedK) << kind << " at " << where;
    // The fraction places p within the mass of k: its error, times the mass
    // over p, is the relative error in the probability.
    const double err = std::fabs(f - expectedF) * massOverP;
    report.add(kind + "_quant", err, where);
    EXPECT_LE(err, kQuantileTolerance)
        << kind << " fraction " << f << " vs " << expectedF << " at " << where;
  }
  EXPECT_GT(poissonRows, 100);
}

}  // namespace
