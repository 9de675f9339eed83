// Numeric limits shared by the high-accuracy (ELV) routines, and the small
// helpers they use to test arguments without raising a floating-point trap.
#ifndef QEL_SRC_UTILITIES_ELVLIMITS_H
#define QEL_SRC_UTILITIES_ELVLIMITS_H

#include <cmath>

namespace qel {
namespace elv {

// A logarithm below this counts as underflowed to 0.
constexpr double kUnderflowLog = -662.34472;
// The logarithm of the smallest normal double: the underflow limit on a
// thread that asked for deep tails.
constexpr double kDeepUnderflowLog = -708.3964185322641;

// Deep tails: the exported distribution functions answer tails down to the
// smallest normal double, below the routines' own underflow limit (where a
// direct call reports an exact 0 with code 1). Set per thread by a scope.
//
// Read on every underflow test, so it takes the initial-exec TLS model: an
// offset from the thread pointer, where the default model of a shared
// library calls __tls_get_addr on each read. The flag is one byte of the
// static TLS block that glibc keeps spare for libraries loaded at run time.
#define QEL_FAST_TLS __attribute__((tls_model("initial-exec")))
inline thread_local bool deepTails QEL_FAST_TLS = false;

inline double underflowLog() {
  return deepTails ? kDeepUnderflowLog : kUnderflowLog;
}

class DeepTailScope {
 public:
  DeepTailScope() : saved_(deepTails) { deepTails = true; }
  ~DeepTailScope() { deepTails = saved_; }
  DeepTailScope(const DeepTailScope&) = delete;
  DeepTailScope& operator=(const DeepTailScope&) = delete;

 private:
  bool saved_;
};
// A logarithm above this counts as overflowed (Gamma, expansions).
constexpr double kOverflowLog = 709.78271;
// Largest shape parameter, Poisson mean or sample size.
constexpr double kMaxShape = 94906265.0;
// Integer forms: admissible strictly below this.
constexpr long kMaxCount = 94906266;
// Largest degrees of freedom; gamma_df answers 1 above this argument.
constexpr double kMaxDf = 189812530.0;
// A noncentrality L needs shape + L + kWidthFactor sqrt(L) <= kMaxShape.
constexpr double kWidthFactor = 6.1738;
// A distribution argument below this counts as 0.
constexpr double kTinyArgument = 2.2250738585072014e-288;
// The term cut-off, Newton step limit and mixture stop are the precision
// setting of precision.h.
// Admissible probability argument of the quantile functions.
constexpr double kMinQuantileP = 1e-12;
constexpr double kMaxQuantileP = 0.5;
// Largest double; its negative marks a failed quantile.
constexpr double kHuge = 1.7976931348623157e308;

// Range tests that are false for NaN and never compare a NaN (an ordered
// comparison with a NaN would trap in the armed floating-point state).
inline bool isNan(double x) {
  return std::isnan(x);
}
inline bool anyNan(double a, double b) {
  return isNan(a) || isNan(b);
}
inline bool anyNan(double a, double b, double c) {
  return isNan(a) || anyNan(b, c);
}

// Exponential of a logarithm that may lie below the underflow limit.
inline double expOrZero(double logValue) {
  return logValue < underflowLog() ? 0.0 : std::exp(logValue);
}

}  // namespace elv
}  // namespace qel

#endif
