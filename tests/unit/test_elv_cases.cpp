// Edge and branch cases of the ELV routines, one call per row of
// tests/data/elv_cases.csv (tools/reference/gen_elv_cases.py): refused
// arguments, their failure outputs and routine names, the exact answers at
// the ends of the ranges, the branch numbers and step counters. Every call
// runs in the armed floating-point state; a routine with a forwarding
// wrapper is called through it, and the wrapper's status must be ELVerrno.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <cstdlib>
#include <string>

#include "elv_calls.h"
#include "utilities/elv/precision.h"
#include "reference_data.h"

namespace {

using qeltest::relativeError;

// A field of the table: '*' (unchecked), a number, or a range lo..hi.
bool matches(const std::string& field, double got, double tol) {
  if (field == "*") return true;
  const auto dots = field.find("..");
  if (dots != std::string::npos) {
    return got >= std::strtod(field.substr(0, dots).c_str(), nullptr) &&
           got <= std::strtod(field.substr(dots + 2).c_str(), nullptr);
  }
  const double want = std::strtod(field.c_str(), nullptr);
  return want == 0.0 ? got == 0.0 : relativeError(got, want) <= tol;
}

// The rows pin the historical setting's branches, step counts and codes of
// every family; the double-precision default is held to the reference tails
// and quantiles elsewhere.
TEST(ElvCases, EdgesAndBranchesOfEveryRoutine) {
  const qel::elv::ScopedElvPrecision historical(qel::elv::ElvPrecision::Historical);
  const auto rows = qeltest::loadReferenceData("elv_cases.csv", 14);
  ASSERT_GT(rows.size(), 200u);
  for (const auto& row : rows) {
    const auto& f = row.text;
    const std::string where = "elv_cases.csv:" + std::to_string(row.line) + " " + f[0];
    const auto call = qeltest::elvCalls().find(f[0]);
    ASSERT_NE(call, qeltest::elvCalls().end()) << where;
    double a[4], o[3];
    for (int i = 0; i < 4; ++i) a[i] = std::strtod(f[1 + i].c_str(), nullptr);
    const int status = qeltest::runArmed(call->second, a, o, where);
    if (f[0] != "Tha_c" && f[0] != "beta_Iabx" && f[0] != "beta_Jabx" &&
        f[0] != "beta_J_complete") {
      EXPECT_EQ(status, ELVerrno) << where << ": the wrapper's status is not the routine's";
    }
    if (f[5] == "ok") {
      EXPECT_TRUE(status == 0 || status == 1) << where << ": status " << status;
    } else {
      EXPECT_TRUE(matches(f[5], status, 0)) << where << ": status " << status;
    }
    EXPECT_TRUE(matches(f[6], ELVmethod, 0)) << where << ": method " << ELVmethod;
    if (f[7] != "*") {
      EXPECT_EQ(std::string(ELVroutine), f[7]) << where;
    }
    const double tol = f[13] == "*" ? 1e-14 : std::strtod(f[13].c_str(), nullptr);
    for (int i = 0; i < 3; ++i) {
      EXPECT_TRUE(matches(f[8 + i], o[i], tol)) << where << ": output " << i << " is " << o[i];
    }
    EXPECT_TRUE(matches(f[11], ELVsteps1, 0)) << where << ": steps1 " << ELVsteps1;
    EXPECT_TRUE(matches(f[12], ELVsteps2, 0)) << where << ": steps2 " << ELVsteps2;
  }
}

}  // namespace
