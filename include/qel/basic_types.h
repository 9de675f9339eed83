/// \file
/// Shared vocabulary of libqel: enumerations, message codes, the NaN and
/// infinity markers and the floating-point state switches of the call frame.
///
/// The exception contract of the armed frame is written at
/// qel::RegisterLynSigfpeHandler and on the \ref mainpage "main page".
#ifndef QEL_BASIC_TYPES_H
#define QEL_BASIC_TYPES_H

#include <qel/export.h>

namespace qel {

/// Alternative hypotheses. EAlternative is the spelling of the unversioned
/// functions, AlternativeHypothesis that of the versioned test layers; the
/// values are the same and pass into each other unchanged.
enum EAlternative : int {
  kAlternativeLess = -1,     ///< the P-value is the lower tail
  kAlternativeNotEqual = 0,  ///< two-sided: twice the smaller tail
  kAlternativeGreater = 1    ///< the P-value is the upper tail
};
/// The spelling of EAlternative in the versioned test layers (qel::v0, qel::v1).
typedef EAlternative AlternativeHypothesis;

/// Sides of a confidence interval; the open side of a one-sided interval is
/// an infinity.
enum IntervalType : int {
  kIntervalUpperBound = -1,  ///< (-inf, upper]
  kIntervalTwoSided = 0,     ///< [lower, upper]
  kIntervalLowerBound = 1    ///< [lower, +inf)
};

/// Side of a confidence bound, named by the bound it gives; each goes with
/// the alternative whose test it inverts.
enum EConfidenceType : int {
  kConfidenceLowerSide = -1,  ///< goes with kAlternativeGreater
  kConfidenceTwoSided = 0,    ///< goes with kAlternativeNotEqual
  kConfidenceUpperSide = 1    ///< goes with kAlternativeLess
};

/// Plotting positions, i counted from 0 in a sample of size n.
enum PlottingMethod : int {
  kPlotMedianRank = 0,  ///< (i + 0.7) / (n + 0.4)
  kPlotMeanRank = 1,    ///< (i + 1) / (n + 1)
  kPlotMidpoint = 2,    ///< (i + 0.5) / n
  kPlotStep = 3         ///< (i + 1) / n
};

/// Basic random number generators; only the combined congruential one exists.
enum BasicRng : int {
  kRngCombinedCongruential = 10  ///< three prime-modulus streams (after Wichmann and Hill)
};

/// \name Message codes
/// Message codes: 0 is success, 10000..10004 warnings with valid results,
/// 20003 and above failures. The warnings are named where they arise
/// (qelWarnADPValueUpperBound in <qel/fits.h>, the sign and Mood tests); the
/// \ref mainpage "main page" lists every code.
//@{
constexpr int qelOk = 0;                           ///< success
constexpr int qelFailRandomVariate = 20003;        ///< a random variate could not be drawn
constexpr int qelFailNoFit = 20004;                ///< an iterative fit did not converge
constexpr int qelFailNoConvergence = 30000;        ///< an iteration or search did not converge
constexpr int qelFailOutOfMemory = 30001;          ///< memory ran out
constexpr int qelFailBadEnumValue = 30002;         ///< an enumeration or level out of range
constexpr int qelFailNotPositiveDefinite = 30006;  ///< a matrix is not positive definite
constexpr int qelFailNotImplemented = 30011;       ///< named by the interface, not provided
constexpr int qelFailUnknownSelector = 30017;      ///< an unknown selector (type, generator)
constexpr int qelFailSingular = 30019;             ///< a singular system: nothing could be fitted
constexpr int qelFailRootNoValue = 30020;          ///< root search: no function value at an end
constexpr int qelFailRootNoBracket = 30021;        ///< root search: no sign change
constexpr int qelFailDegenerateData = 30023;       ///< degenerate data (all values identical)
constexpr int qelFailSignalHandler = 99998;        ///< the SIGFPE handler could not be installed
//@}

/// \name Markers at the exported boundary
/// Markers at the exported boundary: NaN means "not available".
//@{
/// True when x is a NaN.
QEL_API bool IsNaN(double x);
/// True when a result is "not available": a NaN.
QEL_API bool IsResultNA(double x);
/// True for +inf and -inf.
QEL_API bool IsInfinity(double x);
/// True for +inf.
QEL_API bool IsPlusInfinity(double x);
/// True for -inf.
QEL_API bool IsMinusInfinity(double x);
//@}

/// \name Floating-point states
/// The two floating-point states. SetLynFpuStates arms the thread: double
/// precision, round to nearest, traps on invalid operation, division by zero
/// and overflow, denormal operands read as zero. ResetFpuStates restores the
/// fixed default state (everything masked); it does not restore a saved state.
//@{
/// Arms the calling thread: double precision, round to nearest, traps on
/// invalid operation, division by zero and overflow, denormal operands read
/// as zero.
QEL_API void SetLynFpuStates();
/// Restores the fixed default state of the calling thread (every exception
/// masked); it does not restore a saved state. The recovery step after an
/// exception from an armed call.
QEL_API void ResetFpuStates();
//@}

/// Installs the SIGFPE handler that turns a trap in an armed thread into a C++
/// exception at the faulting instruction. Returns 0 or qelFailSignalHandler.
///
/// \return 0, or qelFailSignalHandler when the handler cannot be installed.
///
/// <b>Exception contract.</b> Exported functions hold no catch clause. Kernels catch
/// the traps they expect and answer NaN (distribution functions) or a message
/// code (test functions); a trap that no kernel catches leaves the exported
/// function as std::runtime_error, std::overflow_error or
/// std::invalid_argument, without the closing ResetFpuStates, so the thread
/// is still armed when the exception reaches the host. A host that calls the
/// library where such an exception may arise recovers with two lines:
///
/// \code
///   try { p = qel::GammaCdf(x, shape, scale, 0.0, false); }
///   catch (const std::exception&) { qel::ResetFpuStates(); p = NAN; }
/// \endcode
///
/// Without RegisterLynSigfpeHandler a trap is the process's ordinary SIGFPE.
QEL_API int RegisterLynSigfpeHandler();

}  // namespace qel

#endif
