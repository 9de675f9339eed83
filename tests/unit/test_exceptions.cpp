// The exception vocabulary, assertion failures, CmCtrlBreak and matrix_trace.
#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <string>
#include <type_traits>

#include "utilities/LYNExceptions.h"

namespace {

TEST(ExceptionTree, ClassesDeriveFromTheirStandardBases) {
  static_assert(std::is_base_of<std::overflow_error, qel::CmFloatOverflow>::value, "");
  static_assert(std::is_base_of<std::runtime_error, qel::CmFloatOverflow>::value, "");
  static_assert(!std::is_base_of<qel::CmFloatException, qel::CmFloatOverflow>::value, "");
  static_assert(std::is_base_of<qel::CmFloatException, qel::CmNoConvergence>::value, "");
  static_assert(std::is_base_of<std::runtime_error, qel::CmFloatZeroDivide>::value, "");
  static_assert(std::is_base_of<std::domain_error, qel::CmDomainError>::value, "");
  static_assert(std::is_base_of<std::underflow_error, qel::CmUnderflowError>::value, "");
  static_assert(std::is_base_of<std::exception, qel::CmMissionImpossible>::value, "");
  static_assert(std::is_polymorphic<qel::CmCtrlBreak>::value, "");

  EXPECT_STREQ(qel::CmNoConvergence().what(), "float exception");
  EXPECT_STREQ(qel::CmInvalidArgument("bad").what(), "bad");

  // Caught by the standard base, not by the sibling branch.
  bool caughtAsOverflow = false;
  try {
    throw qel::CmFloatOverflow("x");
  } catch (const qel::CmFloatException&) {
    ADD_FAILURE() << "CmFloatOverflow is not a CmFloatException";
  } catch (const std::overflow_error&) {
    caughtAsOverflow = true;
  }
  EXPECT_TRUE(caughtAsOverflow);
}

TEST(Allege, FailureMessageHasTheFixedShape) {
  try {
    qel::allege::AllegeFailure("a", "b", 3);
    FAIL() << "AllegeFailure returned";
  } catch (const qel::allege::AllegeException& e) {
    EXPECT_STREQ(e.what(), "assertion failed: (a) b: 3");
  }
  const int n = 2;
  EXPECT_NO_THROW(QEL_ALLEGE(n == 2));
  try {
    QEL_ALLEGE(n == 3);
    FAIL() << "the check passed";
  } catch (const std::runtime_error& e) {
    const std::string what = e.what();
    EXPECT_EQ(what.rfind("assertion failed: (n == 3) ", 0), 0u) << what;
    EXPECT_NE(what.find("test_exceptions.cpp: "), std::string::npos) << what;
  }
}

TEST(CtrlBreak, FlagBelongsToTheInstance) {
  qel::CmCtrlBreak first;
  qel::CmCtrlBreak second;
  EXPECT_FALSE(first.mGetGlobalCtrlBreakEncountered());
  first.mSetGlobalCtrlBreakEncountered(true);
  first.mCleanup();
  EXPECT_TRUE(first.mGetGlobalCtrlBreakEncountered());
  EXPECT_FALSE(second.mGetGlobalCtrlBreakEncountered());
}

TEST(MatrixTrace, AppendsLinesToTraceFile) {
  qel::matrix_trace("rows", 3);
  qel::matrix_trace("cols", -1);
  std::ifstream in("trace.txt");
  std::string first, second;
  std::getline(in, first);
  std::getline(in, second);
  EXPECT_EQ(first, "rows : 3");
  EXPECT_EQ(second, "cols : -1");
  std::remove("trace.txt");
}

}  // namespace
