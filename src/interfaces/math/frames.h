// The frames that exported distribution functions put around their kernels.
//
// Armed frame: arm the thread, run the kernel, reset to the default state,
// turn the missing value into NaN. There is no catch: an exception that no
// kernel catches leaves towards the host with the thread still armed.
//
// Array form: one state switch serves the whole column. Each element is read
// before it is written and no other element is touched, so out may equal in.
//
// Both armed frames ask the ELV routines for tails down to the smallest
// normal double (limits.h).
//
// Bare frame: the kernel alone, no state call and no translation.
#ifndef QEL_SRC_INTERFACES_MATH_FRAMES_H
#define QEL_SRC_INTERFACES_MATH_FRAMES_H

#include "utilities/LYNBasicTypes.h"
#include "utilities/elv/limits.h"

namespace qel {
namespace frame {

inline double missingToNaN(double result) {
  return mIsNumericMissing(result) ? mQuietNaN() : result;
}

template <class Kernel, class X, class... Params>
double armed(Kernel kernel, X x, Params... params) {
  const elv::DeepTailScope deep;
  SetLynFpuStates();
  const double result = kernel(x, params...);
  ResetFpuStates();
  // Tested in the default state, after the reset.
  return missingToNaN(result);
}

template <class Kernel, class... Params>
void armedArray(Kernel kernel, double* out, const double* in, unsigned long count,
                Params... params) {
  const elv::DeepTailScope deep;
  SetLynFpuStates();
  for (unsigned long i = 0; i < count; ++i) out[i] = missingToNaN(kernel(in[i], params...));
  ResetFpuStates();
}

template <class Kernel, class... Params>
void bareArray(Kernel kernel, double* out, const double* in, unsigned long count,
               Params... params) {
  for (unsigned long i = 0; i < count; ++i) out[i] = kernel(in[i], params...);
}

}  // namespace frame
}  // namespace qel

// Defines the scalar and the array form of one exported function around a
// kernel. PARAMS is the parenthesised parameter list after the first
// argument, ARGS the matching parenthesised argument names.
#define QEL_FRAME_UNPACK(...) __VA_ARGS__

#define QEL_DEFINE_FAMILY_FUNCTION(Name, Kernel, Frame, ArrayFrame, PARAMS, ARGS)          \
  double Name(double x, QEL_FRAME_UNPACK PARAMS) {                                         \
    return Frame(Kernel, x, QEL_FRAME_UNPACK ARGS);                                        \
  }                                                                                        \
  void Name(double* out, const double* in, unsigned long count, QEL_FRAME_UNPACK PARAMS) { \
    ArrayFrame(Kernel, out, in, count, QEL_FRAME_UNPACK ARGS);                             \
  }

#endif
