// Both tails (and the density or mass) of the ELV distribution routines
// against mpmath (tools/reference/gen_elv_*.py), one loop over every file.
// Each routine runs in the armed floating-point state, so a trap fails.
// Status 0: every output to 1e-8 relative error (the series stop at a
// relative term of 1e-9). Status 1: a tail was set to 0, and the reference
// confirms it lies below the underflow limit exp(-662.34472); the other tail
// is then exactly 1. Outputs whose reference is below that limit must be
// (near) 0.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <algorithm>
#include <cmath>
#include <set>
#include <string>

#include "elv_calls.h"
#include "reference_data.h"

namespace {

using qeltest::relativeError;

constexpr double kTolerance = 1e-8;
constexpr double kUnderflow = 1e-280;  // below: the output is 0 or tiny
// Arguments below this count as 0: outputs 0 and 1, status 0.
constexpr double kTinyArgument = 2.2250738585072014e-288;

struct TailFile {
  const char* file;
  const char* call;
  int args;           // leading argument columns
  int outputs;        // lower, upper and perhaps the density or mass
  int tinyColumn;     // column of the continuous argument, or -1
  bool swapFirstTwo;  // the file lists (a, x) for a call of (x, a)
};

const TailFile kFiles[] = {
    {"elv_normal.csv", "normal_df", 1, 2, -1, false},
    {"elv_gamma.csv", "gamma_df", 2, 3, 1, true},
    {"elv_poisson.csv", "poisson_df", 2, 3, -1, false},
    {"elv_ncchi2.csv", "chi2_ncdf", 3, 2, -1, false},
    {"elv_beta_df.csv", "beta_df", 3, 3, 0, false},
    {"elv_beta_ncdf.csv", "beta_ncdf", 4, 2, 0, false},
    {"elv_binomial_df.csv", "binomial_df", 3, 3, -1, false},
    {"elv_F_df.csv", "F_ncdf", 4, 2, -1, false},
    {"elv_hypergeo.csv", "hypergeo_df", 4, 3, -1, false},
};

double run(const std::string& call, double* a, double* o, const std::string& where) {
  return qeltest::runArmed(qeltest::elvCalls().at(call), a, o, where);
}

// Identities with a second routine, checked on every row: the chi-square
// law is the gamma law at twice the argument and shape (density halved); the F law at L = 0
// is the central one.
void checkSecondForm(const std::string& call, const double* a, const double* o, int status,
                     const std::string& where) {
  double b[4] = {a[0], a[1], a[2], a[3]}, p[3];
  if (call == "gamma_df" && 2 * a[0] <= 189812530.0 && 2 * a[1] <= 189812530.0) {
    b[0] = 2 * a[0], b[1] = 2 * a[1];
    if (run("chi2_df", b, p, where) == 0 && status == 0) {
      EXPECT_LE(std::max(relativeError(p[0], o[0]), relativeError(p[1], o[1])), 1e-12) << where;
      // Its density at 2x is half the gamma density at x.
      EXPECT_LE(relativeError(p[2], 0.5 * o[2]), 1e-12) << where;
    }
  } else if (call == "chi2_ncdf") {
    b[0] = a[0] / 2, b[1] = a[1] / 2, b[2] = a[2] / 2;
    EXPECT_EQ(run("gamma_ncdf", b, p, where), status) << where;
  } else if (call == "F_ncdf" && a[3] == 0.0) {
    run("F_df", b, p, where);
    EXPECT_EQ(p[0], o[0]) << where;
    EXPECT_EQ(p[1], o[1]) << where;
  }
}

TEST(ElvTails, EveryRoutineMatchesReference) {
  for (const TailFile& file : kFiles) {
    std::set<long long> methods;
    int rows = 0;
    for (const auto& row : qeltest::loadReferenceData(file.file, 0)) {
      const std::string where = std::string(file.file) + ":" + std::to_string(row.line);
      double a[4] = {0, 0, 0, 0}, o[3];
      std::copy(row.numbers.begin(), row.numbers.begin() + file.args, a);
      if (file.swapFirstTwo) std::swap(a[0], a[1]);
      const double* want = row.numbers.data() + file.args;
      const int status = run(file.call, a, o, where);
      ++rows;
      methods.insert(ELVmethod);
      if (file.tinyColumn >= 0 && row.numbers[file.tinyColumn] < kTinyArgument) {
        EXPECT_EQ(status, 0) << where;
        EXPECT_EQ(o[0], 0.0) << where;
        EXPECT_EQ(o[1], 1.0) << where;
        continue;
      }
      ASSERT_TRUE(status == 0 || status == 1) << where << ": status " << status;
      bool zeroed = false;
      for (int i = 0; i < file.outputs; ++i) {
        if (want[i] < kUnderflow) {
          EXPECT_LT(o[i], kUnderflow) << where << ": output " << i << " is " << o[i];
          zeroed = zeroed || (i < 2 && o[i] == 0.0 && o[1 - i] == 1.0);
          continue;
        }
        EXPECT_LE(relativeError(o[i], want[i]), kTolerance)
            << where << ": output " << i << " " << o[i] << " vs " << want[i];
      }
      if (status == 1) {
        EXPECT_TRUE(zeroed) << where << ": status 1 without a tail set to 0";
      }
      checkSecondForm(file.call, a, o, status, where);
    }
    EXPECT_GT(rows, 40) << file.file;
    if (std::string(file.call) == "beta_ncdf") {
      // Both directions, both routines, with and without the hand-over.
      for (long long m : {13LL, 24LL, 1013LL, 1024LL}) EXPECT_TRUE(methods.count(m)) << m;
      EXPECT_TRUE(methods.count(113) || methods.count(124) || methods.count(1113) ||
                  methods.count(1124));
    }
  }
}

}  // namespace
