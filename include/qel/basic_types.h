// Shared vocabulary of libqel: enumerations, message codes, the NaN and
// infinity markers and the floating-point state switches of the call frame.
#ifndef QEL_BASIC_TYPES_H
#define QEL_BASIC_TYPES_H

#include <qel/export.h>

namespace qel {

// Alternative hypotheses. EAlternative is the spelling of the unversioned
// functions, AlternativeHypothesis that of the versioned test layers; the
// values are the same and pass into each other unchanged.
enum EAlternative : int {
  kAlternativeLess = -1,     // the P-value is the lower tail
  kAlternativeNotEqual = 0,  // two-sided: twice the smaller tail
  kAlternativeGreater = 1    // the P-value is the upper tail
};
typedef EAlternative AlternativeHypothesis;

enum IntervalType : int {
  kIntervalUpperBound = -1,  // (-inf, upper]
  kIntervalTwoSided = 0,
  kIntervalLowerBound = 1  // [lower, +inf)
};

enum EConfidenceType : int {
  kConfidenceLowerSide = -1,  // goes with kAlternativeGreater
  kConfidenceTwoSided = 0,    // goes with kAlternativeNotEqual
  kConfidenceUpperSide = 1    // goes with kAlternativeLess
};

// Plotting positions, i counted from 0 in a sample of size n.
enum PlottingMethod : int {
  kPlotMedianRank = 0,  // (i + 0.7) / (n + 0.4)
  kPlotMeanRank = 1,    // (i + 1) / (n + 1)
  kPlotMidpoint = 2,    // (i + 0.5) / n
  kPlotStep = 3         // (i + 1) / n
};

// Basic random number generators; only the combined congruential one exists.
enum BasicRng : int { kRngCombinedCongruential = 10 };

// Message codes: 0 is success, 10000..10004 warnings with valid results,
// 20003 and above failures.
constexpr int qelOk = 0;
constexpr int qelFailRandomVariate = 20003;
constexpr int qelFailNoFit = 20004;
constexpr int qelFailNoConvergence = 30000;
constexpr int qelFailOutOfMemory = 30001;
constexpr int qelFailBadEnumValue = 30002;
constexpr int qelFailNotPositiveDefinite = 30006;
constexpr int qelFailNotImplemented = 30011;
constexpr int qelFailUnknownSelector = 30017;
constexpr int qelFailSingular = 30019;
constexpr int qelFailRootNoValue = 30020;
constexpr int qelFailRootNoBracket = 30021;
constexpr int qelFailDegenerateData = 30023;
constexpr int qelFailSignalHandler = 99998;

// Markers at the exported boundary: NaN means "not available".
QEL_API bool IsNaN(double x);
QEL_API bool IsResultNA(double x);
QEL_API bool IsInfinity(double x);
QEL_API bool IsPlusInfinity(double x);
QEL_API bool IsMinusInfinity(double x);

// The two floating-point states. SetLynFpuStates arms the thread: double
// precision, round to nearest, traps on invalid operation, division by zero
// and overflow, denormal operands read as zero. ResetFpuStates restores the
// fixed default state (everything masked); it does not restore a saved state.
QEL_API void SetLynFpuStates();
QEL_API void ResetFpuStates();

// Installs the SIGFPE handler that turns a trap in an armed thread into a C++
// exception at the faulting instruction. Returns 0 or qelFailSignalHandler.
//
// Exception contract. Exported functions hold no catch clause. Kernels catch
// the traps they expect and answer NaN (distribution functions) or a message
// code (test functions); a trap that no kernel catches leaves the exported
// function as std::runtime_error, std::overflow_error or
// std::invalid_argument, without the closing ResetFpuStates, so the thread
// is still armed when the exception reaches the host. A host that calls the
// library where such an exception may arise recovers with two lines:
//
//   try { p = qel::GammaCdf(x, shape, scale, 0.0, false); }
//   catch (const std::exception&) { qel::ResetFpuStates(); p = NAN; }
//
// Without RegisterLynSigfpeHandler a trap is the process's ordinary SIGFPE.
QEL_API int RegisterLynSigfpeHandler();

}  // namespace qel

#endif
