// The frames that exported distribution functions put around their kernels.
//
// Armed frame: arm the thread, run the kernel, reset to the default state,
// turn the missing value into NaN. There is no catch: an exception that no
// kernel catches leaves towards the host with the thread still armed.
//
// Array form: one state switch serves the whole column. Each element is read
// before it is written and no other element is touched, so out may equal in.
//
// All armed frames ask the ELV routines for tails down to the smallest
// normal double (limits.h).
//
// Bare frame: the kernel alone, no state call; the missing value still
// becomes NaN, since it never leaves an exported function.
//
// The checked forms (family functions) first refuse parameters outside the
// family's domain and answer NaN and infinite arguments without the kernel
// (domains.h); those answers leave the floating-point state untouched.
#ifndef QEL_SRC_INTERFACES_MATH_FRAMES_H
#define QEL_SRC_INTERFACES_MATH_FRAMES_H

#include <cstdint>
#include <cstring>

#include "interfaces/math/domains.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/LYNFloatingPoint.h"
#include "utilities/elv/limits.h"

namespace qel {
namespace frame {

// The missing value's bit pattern (mGetMissingValueCode), compared inline:
// this runs once per element of every array form.
inline double missingToNaN(double result) {
  constexpr std::uint64_t kMissingBits = 0x462F2A2831AE5ED5ULL;
  std::uint64_t bits;
  std::memcpy(&bits, &result, sizeof bits);
  return bits == kMissingBits ? mQuietNaN() : result;
}

// The compiler does not see that arithmetic depends on the floating-point
// state: an inlined kernel's register arithmetic could move across the state
// switches. An empty asm that claims to change its operand pins the value to
// its place in the instruction stream (no instruction is emitted).
inline double pinned(double v) {
  __asm__ __volatile__("" : "+x"(v));
  return v;
}
template <class T>
inline T pinned(T v) {
  __asm__ __volatile__("" : "+m"(v));
  return v;
}

// Inlined into each exported function, so that the kernel is a direct call
// and the whole frame costs the four state loads and a few moves. The
// argument is pinned after arming and the result before the reset, so the
// kernel runs armed even where it is inlined.
template <class Kernel, class X, class... Params>
__attribute__((always_inline)) inline double armed(Kernel kernel, X x, Params... params) {
  const elv::DeepTailScope deep;
  fpu::arm();
  const double result = pinned(kernel(pinned(x), params...));
  fpu::reset();
  // Tested in the default state, after the reset.
  return missingToNaN(result);
}

template <class Kernel, class... Params>
void armedArray(Kernel kernel, double* out, const double* in, unsigned long count,
                Params... params) {
  const elv::DeepTailScope deep;
  fpu::arm();
  for (unsigned long i = 0; i < count; ++i) out[i] = missingToNaN(kernel(in[i], params...));
  fpu::reset();
}

inline void fillNaN(double* out, unsigned long count) {
  for (unsigned long i = 0; i < count; ++i) out[i] = mQuietNaN();
}

// Array form of a family function: elements that their argument decides
// alone are answered without the kernel; the others run in one armed span.
template <class Kernel, class... Params>
void checkedArmedArray(domain::Kind kind, bool upperTail, Kernel kernel, double* out,
                       const double* in, unsigned long count, Params... params) {
  const elv::DeepTailScope deep;
  fpu::arm();
  for (unsigned long i = 0; i < count; ++i) {
    double answer;
    const double x = in[i];
    out[i] = domain::decidedByArgument(kind, x, upperTail, &answer)
                 ? answer
                 : missingToNaN(kernel(x, params...));
  }
  fpu::reset();
}

template <class Kernel, class... Params>
void checkedBareArray(domain::Kind kind, bool upperTail, Kernel kernel, double* out,
                      const double* in, unsigned long count, Params... params) {
  for (unsigned long i = 0; i < count; ++i) {
    double answer;
    const double x = in[i];
    out[i] = domain::decidedByArgument(kind, x, upperTail, &answer)
                 ? answer
                 : missingToNaN(kernel(x, params...));
  }
}

template <class Kernel, class... Params>
double bare(Kernel kernel, double x, Params... params) {
  return missingToNaN(kernel(x, params...));
}

}  // namespace frame
}  // namespace qel

// Defines the scalar and the array form of one exported family function
// around a kernel. PARAMS is the parenthesised parameter list after the first
// argument, ARGS the matching parenthesised argument names, VALID the
// family's domain check on them and TAIL the upper-tail flag (false where the
// function has none).
#define QEL_FRAME_UNPACK(...) __VA_ARGS__

#define QEL_DEFINE_FAMILY_FUNCTION(Name, Kind, Kernel, Frame, ArrayFrame, PARAMS, ARGS, VALID, \
                                   TAIL)                                                       \
  double Name(double x, QEL_FRAME_UNPACK PARAMS) {                                             \
    double answer;                                                                             \
    if (!(VALID)) return mQuietNaN();                                                          \
    if (domain::decidedByArgument(Kind, x, TAIL, &answer)) return answer;                      \
    return Frame(Kernel, x, QEL_FRAME_UNPACK ARGS);                                            \
  }                                                                                            \
  void Name(double* out, const double* in, unsigned long count, QEL_FRAME_UNPACK PARAMS) {     \
    if (!(VALID)) return frame::fillNaN(out, count);                                           \
    ArrayFrame(Kind, TAIL, Kernel, out, in, count, QEL_FRAME_UNPACK ARGS);                     \
  }

#endif
