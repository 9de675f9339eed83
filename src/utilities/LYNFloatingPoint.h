// The two floating-point states of the call frame, as inline switches for
// the frames around exported functions (SetLynFpuStates and ResetFpuStates
// are the exported forms of the same two switches).
//
// Armed: x87 control word 0x272 (invalid, divide-by-zero and overflow traps
// open; denormal, underflow and inexact masked; 53-bit precision; round to
// nearest) and MXCSR 0x1940 (the same traps, denormals-are-zero on).
// Default: x87 control word 0x37F and MXCSR 0x1F80 (everything masked,
// 64-bit x87 precision, DAZ and FTZ off, no exception flag standing).
//
// Cost: the control words change on every call, so FLDCW and LDMXCSR are
// paid each way (a few ns). What made the frame slow was FNINIT and FNCLEX,
// which are microcoded (15 to 40 ns each on current x86). Both are needed
// only when an x87 exception flag stands: opening a trap whose flag is set
// would raise it at the next x87 instruction. Double arithmetic runs on SSE,
// so the x87 status word is almost always clean; reading it (FNSTSW) costs a
// cycle or two, and the clearing instruction runs only when a flag is set.
// The x87 register stack is empty at every call boundary (the x86-64 ABI),
// so FNINIT's reset of the tag word is not needed either.
#ifndef QEL_SRC_UTILITIES_LYNFLOATINGPOINT_H
#define QEL_SRC_UTILITIES_LYNFLOATINGPOINT_H

#include <cstdint>

namespace qel {
namespace fpu {

constexpr std::uint16_t kArmedX87 = 0x272;
constexpr std::uint16_t kDefaultX87 = 0x37F;
constexpr std::uint32_t kArmedMxcsr = 0x1940;
constexpr std::uint32_t kDefaultMxcsr = 0x1F80;
// x87 status word: the six exception flags, stack fault and error summary.
constexpr std::uint16_t kX87Flags = 0xFF;

inline std::uint16_t x87Status() {
  std::uint16_t status;
  __asm__ __volatile__("fnstsw %0" : "=a"(status) : : "memory");
  return status;
}

// The rare paths, out of line: a real call, so that an exception raised by
// FWAIT unwinds through the caller's cleanups like any call's would.
void dropX87Flags();
void deliverAndDropX87Flags();

inline void arm() {
  std::uint16_t cw = kArmedX87;
  std::uint32_t csr = kArmedMxcsr;
  // A standing flag would trap as soon as its mask opens: drop it first.
  if (x87Status() & kX87Flags) dropX87Flags();
  __asm__ __volatile__(
      "fldcw %0\n\t"
      "ldmxcsr %1"
      :
      : "m"(cw), "m"(csr)
      : "memory");
}

inline void reset() {
  std::uint16_t cw = kDefaultX87;
  std::uint32_t csr = kDefaultMxcsr;
  // FWAIT delivers a pending unmasked x87 exception while the thread is
  // still armed (as a trap, turned into an exception by the handler); then
  // the flags go. Without a standing flag neither has anything to do.
  if (x87Status() & kX87Flags) deliverAndDropX87Flags();
  __asm__ __volatile__(
      "fldcw %0\n\t"
      "ldmxcsr %1"
      :
      : "m"(cw), "m"(csr)
      : "memory");
}

}  // namespace fpu
}  // namespace qel

#endif
