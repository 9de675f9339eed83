// The ELV error frame (startup, the "F"/"N" exit rule, texts, perror) and the
// shared arithmetic helpers against mpmath values.
#include <gtest/gtest.h>
#include <qel/elv.h>

#include <cerrno>
#include <cmath>
#include <cstring>
#include <map>
#include <string>
#include <thread>

#include "reference_data.h"
#include "utilities/elv/limits.h"
#include "utilities/elv/wrappers.h"

namespace {

constexpr double kHuge = 1.7976931348623157e308;

TEST(ElvFrame, StartupClearsTheCodeAndNamesTheRoutine) {
  ELVexit("gamma_df", 4, 'F');
  ELVstartup("poisson_df");
  EXPECT_EQ(ELVerrno, 0);
  EXPECT_STREQ(ELVroutine, "poisson_df");
}

TEST(ElvFrame, RoutineNameKeepsThirtyBytes) {
  const std::string longName(45, 'r');
  ELVstartup(longName.c_str());
  EXPECT_EQ(std::strlen(ELVroutine), 30u);
  EXPECT_EQ(std::string(ELVroutine), longName.substr(0, 30));
}

TEST(ElvFrame, NormalExitKeepsAnInnerFailure) {
  ELVstartup("outer");
  ELVexit("inner", 2, 'F');
  ELVexit("x", 0, 'N');
  EXPECT_EQ(ELVerrno, 2);
  EXPECT_STREQ(ELVroutine, "inner");
  // A larger code replaces it, an equal one does not.
  ELVexit("y", 2, 'N');
  EXPECT_STREQ(ELVroutine, "inner");
  ELVexit("z", 4, 'N');
  EXPECT_EQ(ELVerrno, 4);
  EXPECT_STREQ(ELVroutine, "z");
}

TEST(ElvFrame, ForcedExitMayDowngrade) {
  ELVexit("inner", 2, 'F');
  ELVexit("x", 0, 'F');
  EXPECT_EQ(ELVerrno, 0);
  EXPECT_STREQ(ELVroutine, "x");
}

TEST(ElvFrame, NestedStartupWipesTheCallersCode) {
  // gamma_upper_quant runs gamma_df inside: after a successful run the
  // status is 0 although the outer routine opened first.
  ELVexit("earlier", 3, 'F');
  double q = 0;
  gamma_upper_quant(0.1, 0.5, &q);
  EXPECT_EQ(ELVerrno, 0);
  // An inner failure standing through the outer routine's normal exit is a
  // row of elv_cases.csv (chi2_df with 0 degrees of freedom).
}

TEST(ElvFrame, TextsAndStatusClasses) {
  EXPECT_STREQ(ELVstrerror(0), "no errors detected");
  EXPECT_STREQ(ELVstrerror(1), "partial loss of significance (result set to 0)");
  EXPECT_STREQ(ELVstrerror(2), "argument out of admissable range");
  EXPECT_STREQ(ELVstrerror(3), "invalid combination of parameters");
  EXPECT_STREQ(ELVstrerror(4), "internal failure of algorithm");
  EXPECT_EQ(ELVerrlist[2], ELVstrerror(2));
  EXPECT_FALSE(qel::ElvFailed(qel::ElvNoError));
  EXPECT_FALSE(qel::ElvFailed(qel::ElvLossOfSignificance));
  EXPECT_TRUE(qel::ElvFailed(qel::ElvArgumentOutOfRange));
  EXPECT_TRUE(qel::ElvFailed(qel::ElvInvalidCombination));
  EXPECT_TRUE(qel::ElvFailed(qel::ElvInternalFailure));
  EXPECT_TRUE(qel::ElvFailed(static_cast<qel::ElvStatus>(5)));
}

TEST(ElvFrame, PerrorFormats) {
  ELVexit("chi2_ncdf", 3, 'F');
  testing::internal::CaptureStderr();
  ELVperror(nullptr);
  ELVperror("qel");
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "invalid combination of parameters (issued from: chi2_ncdf)\n"
            "qel: invalid combination of parameters (issued from: chi2_ncdf)\n");
}

// Helpers at their refused arguments: the C errno and the stated substitute.
TEST(ElvArithmetic, RefusedArgumentsSetErrno) {
  struct Case {
    double (*f)(double);
    double x, result;
    int error;
  };
  const Case cases[] = {{logs, -1.5, -kHuge, 33},
                        {exps, 710.0, -kHuge, 33},
                        {exps, -663.0, -kHuge, 33},
                        {ln_gamma, 0.0, -kHuge, 33},
                        {ln_scaled_gamma, -1.0, kHuge, 33},
                        {Gamma, 0.0, 0.0, 33},
                        {Gamma, 172.0, kHuge, 34},
                        {gammod, 1.5, kHuge, 33},
                        {inv_normal_df0, 1.0, -kHuge, 33},
                        {ln_scaled_gamma, 0.0, 0.0, 0},
                        {Gamma, 1e-17, 1e17, 0}};
  for (const Case& c : cases) {
    errno = 0;
    EXPECT_EQ(c.f(c.x), c.result) << c.x;
    EXPECT_EQ(errno, c.error) << c.x;
  }
}

TEST(ElvArithmetic, LogsSwitchesToTheLibraryAboveOnePercent) {
  // 0.02 goes through log(1+x), whose rounding of 1+x shows; 0.005 through
  // the polynomial, which is exact to the last bits.
  EXPECT_EQ(logs(0.02), std::log(1.0 + 0.02));
  EXPECT_NEAR(logs(0.005), std::log1p(0.005), 1e-19);
  EXPECT_NE(logs(0.005), std::log(1.0 + 0.005));
}

TEST(ElvArithmetic, MatchesHighPrecisionValues) {
  const auto rows = qeltest::loadReferenceData("elv_arithmetic.csv", 1);
  ASSERT_GT(rows.size(), 100u);
  std::map<std::string, double> worst;
  for (const auto& row : rows) {
    const std::string& f = row.text[0];
    const double* v = row.numbers.data();
    const double expected = row.numbers[4];
    double actual = NAN;
    if (f == "logs") actual = logs(v[0]);
    if (f == "exps") actual = exps(v[0]);
    if (f == "ln_gamma") actual = ln_gamma(v[0]);
    if (f == "ln_scaled_gamma") actual = ln_scaled_gamma(v[0]);
    if (f == "Gamma") actual = Gamma(v[0]);
    if (f == "gammod") actual = gammod(v[0]);
    if (f == "psi") actual = psi(v[0]);
    if (f == "dpsi") actual = dpsi(v[0]);
    if (f == "d2psi") actual = d2psi(v[0]);
    if (f == "phi") actual = phi(v[0]);
    if (f == "lnpgamma") lnpgamma(&actual, v[0], v[1]);
    if (f == "lnpbeta") lnpbeta(&actual, v[0], v[1], v[2]);
    if (f == "lnppoisson") lnppoisson(v[0], &actual, v[1]);
    if (f == "lnpbinomial") lnpbinomial(v[0], v[1], &actual, v[2]);
    if (f == "lnphyper") lnphyper(v[0], v[1], v[2], v[3], &actual);
    // Relative error, absolute near the zeros of ln_gamma and psi.
    const double err = std::fabs(actual - expected) / std::fmax(1.0, std::fabs(expected));
    worst[f] = std::fmax(worst[f], err);
    // gammod forms (1 - Gamma(1+x))/x above 1e-4: the cancellation costs
    // about four digits there.
    const double tolerance = f == "gammod" ? 1e-10 : 1e-11;
    EXPECT_LE(err, tolerance) << f << "(" << v[0] << ", " << v[1] << ", " << v[2] << ", " << v[3]
                              << ") = " << actual << ", expected " << expected << " (line "
                              << row.line << ")";
  }
  for (const auto& [f, err] : worst) {
    std::printf("[ accuracy ] %-28s largest error %.3g\n", f.c_str(), err);
  }
  EXPECT_EQ(worst.size(), 15u);
}

// The deep-tail flag belongs to the thread that opened the scope, and the
// scope restores what it found, nested or not.
TEST(ElvFrame, DeepTailScopeIsPerThreadAndRestores) {
  using qel::elv::underflowLog;
  ASSERT_EQ(underflowLog(), qel::elv::kUnderflowLog);
  double seenByOtherThread = 0.0;
  {
    const qel::elv::DeepTailScope outer;
    std::thread([&] { seenByOtherThread = underflowLog(); }).join();
    { const qel::elv::DeepTailScope inner; }
    EXPECT_EQ(underflowLog(), qel::elv::kDeepUnderflowLog);
  }
  EXPECT_EQ(seenByOtherThread, qel::elv::kUnderflowLog);
  EXPECT_EQ(underflowLog(), qel::elv::kUnderflowLog);
}

}  // namespace
