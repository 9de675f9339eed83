// Every test binary behaves like a host: it installs the SIGFPE handler once,
// before any test runs, and each test starts in the default state.
#include <gtest/gtest.h>
#include <qel/basic_types.h>

namespace {

class FloatingPointEnvironment : public ::testing::Environment {
 public:
  void SetUp() override { ASSERT_EQ(qel::RegisterLynSigfpeHandler(), qel::qelOk); }
};

class ResetStateAfterEachTest : public ::testing::EmptyTestEventListener {
  // A test that fails while armed must not leave its traps to the next test.
  void OnTestEnd(const ::testing::TestInfo&) override { qel::ResetFpuStates(); }
};

const bool registered = [] {
  ::testing::AddGlobalTestEnvironment(new FloatingPointEnvironment);
  ::testing::UnitTest::GetInstance()->listeners().Append(new ResetStateAfterEachTest);
  return true;
}();

}  // namespace
