// The floating-point call frame: the two states, traps turned into
// exceptions by the SIGFPE handler, and the scalar, array and bare frames of
// the exported distribution functions.
#include <gtest/gtest.h>
#include <qel/distributions.h>

#include <cfloat>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <limits>
#include <stdexcept>
#include <string>
#include <vector>

#include "fpu_state.h"
#include "interfaces/math/frames.h"
#include "utilities/LYNBasicTypes.h"

namespace {

using qeltest::isArmedState;
using qeltest::isDefaultState;

std::uint64_t bitsOf(double x) {
  std::uint64_t b;
  std::memcpy(&b, &x, sizeof b);
  return b;
}

// Runs op in an armed thread and returns the message of the exception of
// type E that the trap produced; fails if nothing or something else is thrown.
template <class E, class Op>
std::string trapMessage(Op op) {
  qel::SetLynFpuStates();
  try {
    op();
  } catch (const E& e) {
    return e.what();
  }
  ADD_FAILURE() << "no trap";
  return "";
}

TEST(FpuStates, SetAndResetLoadTheExactControlWords) {
  qel::SetLynFpuStates();
  EXPECT_EQ(qeltest::x87ControlWord(), qeltest::kArmedX87);
  EXPECT_EQ(qeltest::mxcsr(), qeltest::kArmedMxcsr);
  qel::ResetFpuStates();
  EXPECT_EQ(qeltest::x87ControlWord(), qeltest::kDefaultX87);
  EXPECT_EQ(qeltest::mxcsr(), qeltest::kDefaultMxcsr);
  // Reset is idempotent: it restores fixed defaults, nothing saved.
  qel::ResetFpuStates();
  EXPECT_TRUE(isDefaultState());
}

std::uint16_t x87Status() {
  std::uint16_t status;
  __asm__ __volatile__("fnstsw %0" : "=a"(status));
  return status;
}

// The arming switch clears the x87 flags only when one stands: a flag left by
// masked long double arithmetic of the host must not trap once the masks open,
// and no flag outlives the reset.
TEST(FpuStates, StandingX87FlagsNeitherTrapNorOutliveTheFrame) {
  volatile long double zero = 0.0L, one = 1.0L;
  zero = zero / zero;  // invalid, masked in the default state
  ASSERT_NE(x87Status() & 0x3F, 0);
  qel::SetLynFpuStates();
  one = one + one;   // the next x87 instruction: would raise the standing flag
  one = one / 3.0L;  // inexact, masked in the armed state
  qel::ResetFpuStates();
  EXPECT_EQ(x87Status() & 0xFF, 0);
  EXPECT_TRUE(isDefaultState());
  zero = 0.0L;
  zero = zero / zero;
  EXPECT_EQ(qel::NormalCdf(0.5, 0.0, 1.0, false), qel::NormalCdf(-0.5, 0.0, 1.0, true));
  EXPECT_EQ(x87Status() & 0xFF, 0);
  EXPECT_TRUE(isDefaultState());
}

TEST(FpuStates, RegisteringTheHandlerLeavesTheDefaultState) {
  qel::SetLynFpuStates();
  ASSERT_EQ(qel::RegisterLynSigfpeHandler(), qel::qelOk);
  EXPECT_TRUE(isDefaultState());
}

TEST(SigfpeHandler, DivisionByZeroThrowsRuntimeErrorAndStaysArmed) {
  volatile double zero = 0.0;
  volatile double one = 1.0;
  EXPECT_EQ(trapMessage<std::runtime_error>([&] { one = one / zero; }),
            "Float exception: divide by zero.");
  EXPECT_TRUE(isArmedState());
  // The re-armed thread traps again: the handler is not one-shot.
  EXPECT_EQ(trapMessage<std::runtime_error>([&] { one = 2.0 / zero; }),
            "Float exception: divide by zero.");
  qel::ResetFpuStates();
}

TEST(SigfpeHandler, OverflowAndInvalidMapToTheirExceptions) {
  volatile double big = 1e308;
  volatile double zero = 0.0;
  volatile double inf = INFINITY;
  EXPECT_EQ(trapMessage<std::overflow_error>([&] { big = big * 10.0; }),
            "Float exception: overflow.");
  EXPECT_EQ(trapMessage<std::invalid_argument>([&] { zero = zero / zero; }),
            "Float exception: invalid_argument.");
  EXPECT_EQ(trapMessage<std::invalid_argument>([&] { inf = inf - inf; }),
            "Float exception: invalid_argument.");
  EXPECT_TRUE(isArmedState());
  qel::ResetFpuStates();
}

// The division is done in assembly (a C++ division by zero would be undefined
// behaviour) inside a function of its own, so that the compiler sees a call
// that may throw.
__attribute__((noinline)) int divideInAssembly(int numerator, int divisor) {
  __asm__ __volatile__("cltd\n\tidivl %[d]" : "+a"(numerator) : [d] "r"(divisor) : "edx", "cc");
  return numerator;
}

TEST(SigfpeHandler, IntegerDivisionByZeroIsARuntimeError) {
  qel::ResetFpuStates();
  EXPECT_EQ(divideInAssembly(7, 2), 3);
  try {
    divideInAssembly(7, 0);
    ADD_FAILURE() << "no trap";
  } catch (const std::runtime_error& e) {
    EXPECT_STREQ(e.what(), "Runtime exception: integer division by zero.");
  }
}

TEST(SigfpeHandler, UnderflowAndDenormalOperandsDoNotTrapWhenArmed) {
  volatile double tiny = 1e-300;
  volatile double denormal = 1e-310;
  qel::SetLynFpuStates();
  const double underflowed = tiny * tiny;
  const double scaled = denormal * 1e10;  // operand read as zero when armed
  qel::ResetFpuStates();
  EXPECT_EQ(underflowed, 0.0);
  EXPECT_EQ(scaled, 0.0);
  EXPECT_NEAR(denormal * 1e10, 1e-300, 1e-310);  // default state: an ordinary number
}

TEST(ArmedFrame, ExportedCallsLeaveTheDefaultStateEvenWhenNested) {
  EXPECT_DOUBLE_EQ(qel::LogisticCdf(0.0, 0.0, 1.0, false), 0.5);
  EXPECT_TRUE(isDefaultState());
  // A framed call inside an armed section ends that section's armed state.
  qel::SetLynFpuStates();
  qel::CauchyPdf(1.0, 0.0, 1.0);
  EXPECT_TRUE(isDefaultState());
  std::vector<double> v = {0.1, 0.2};
  qel::SetLynFpuStates();
  qel::TriangularInvCdf(v.data(), v.data(), v.size(), 0.0, 0.5, 1.0);
  EXPECT_TRUE(isDefaultState());
}

TEST(ArmedFrame, MissingValueBecomesQuietNaN) {
  const double r = qel::CauchyInvCdf(0.0, 0.0, 1.0);
  EXPECT_TRUE(qel::IsResultNA(r));
  EXPECT_EQ(bitsOf(r), 0x7FF8000000000000ULL);
  EXPECT_TRUE(qel::IsResultNA(qel::LogisticInvCdf(1.0, 0.0, 1.0)));
}

TEST(ArmedFrame, ArrayFormTranslatesPerElementAndWorksInPlace) {
  std::vector<double> p = {0.0, 0.25, 1.0, 0.5, 0.75};
  std::vector<double> out(p.size(), -7.0);
  qel::CauchyInvCdf(out.data(), p.data(), p.size(), 0.0, 1.0);
  EXPECT_TRUE(std::isnan(out[0]));
  EXPECT_NEAR(out[1], -1.0, 1e-15);
  EXPECT_TRUE(std::isnan(out[2]));
  EXPECT_EQ(out[3], 0.0);
  EXPECT_NEAR(out[4], 1.0, 1e-15);
  EXPECT_TRUE(isDefaultState());

  // In place: each element is read before it is written.
  std::vector<double> x = {-1.0, 0.0, 2.0};
  qel::LogisticCdf(x.data(), x.data(), x.size(), 0.0, 1.0, true);
  EXPECT_NEAR(x[0], 1.0 / (1.0 + std::exp(-1.0)), 1e-16);
  EXPECT_EQ(x[1], 0.5);
  EXPECT_NEAR(x[2], 1.0 / (1.0 + std::exp(2.0)), 1e-16);
}

TEST(ArmedFrame, CountZeroWritesNothingAndStillResets) {
  double sentinel[2] = {42.0, 43.0};
  qel::SetLynFpuStates();
  qel::LogisticPdf(sentinel, sentinel, 0UL, 0.0, 1.0);
  EXPECT_TRUE(isDefaultState());
  EXPECT_EQ(sentinel[0], 42.0);
  EXPECT_EQ(sentinel[1], 43.0);
}

TEST(ArmedFrame, OverflowCaughtByTheKernelGivesTheLimit) {
  EXPECT_EQ(qel::LogisticCdf(-1e5, 0.0, 1.0, false), 0.0);
  EXPECT_EQ(qel::LogisticCdf(-1e5, 0.0, 1.0, true), 1.0);
  EXPECT_EQ(qel::LogisticPdf(-1e5, 0.0, 1.0), 0.0);
  EXPECT_TRUE(isDefaultState());
}

TEST(ArmedFrame, UncaughtExceptionsLeaveTheFunctionAndTheThreadArmed) {
  // An overflow that no kernel catches, inside the frame of the exported
  // functions: it leaves the function with the thread armed.
  volatile double big = DBL_MAX;
  const auto product = [](double x, double scale) { return x * scale; };
  EXPECT_THROW(qel::frame::armed(product, 2.0, static_cast<double>(big)), std::runtime_error);
  EXPECT_TRUE(isArmedState());
  qel::ResetFpuStates();
  // In the array form the remaining elements stay unwritten.
  std::vector<double> x = {0.5, 2.0, 0.5};
  std::vector<double> out(3, -1.0);
  EXPECT_THROW(qel::frame::armedArray(product, out.data(), x.data(), 3UL, static_cast<double>(big)),
               std::runtime_error);
  qel::ResetFpuStates();
  EXPECT_GT(out[0], 0.0);
  EXPECT_EQ(out[2], -1.0);
  // The gamma quantile times a scale near DBL_MAX, which once overflowed
  // here, is NaN beyond the double range.
  EXPECT_TRUE(std::isnan(qel::GammaInvCdf(0.5, 2.0, DBL_MAX, 0.0)));
  EXPECT_TRUE(isDefaultState());
}

TEST(BareFrame, UniformTouchesNoStateAndChecksNothing) {
  EXPECT_TRUE(std::isnan(qel::UniformPdf(1.0, 1.0, 1.0)));  // no interval
  qel::SetLynFpuStates();
  EXPECT_EQ(qel::UniformCdf(0.25, 0.0, 1.0, false), 0.25);
  std::vector<double> x = {0.5};
  qel::UniformInvCdf(x.data(), x.data(), 1UL, 2.0, 4.0);
  EXPECT_TRUE(isArmedState());  // the bare frame did not reset
  qel::ResetFpuStates();
  EXPECT_EQ(x[0], 3.0);
}

}  // namespace
