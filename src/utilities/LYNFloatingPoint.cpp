// The floating-point call frame: the armed and default states of the x87 unit
// and of SSE (MXCSR), and the SIGFPE handler that turns a trap into a C++
// exception at the faulting instruction.
//
// Throwing from the handler works because the library is compiled with
// -fnon-call-exceptions (every trapping instruction has unwind information)
// and the kernel's signal trampoline carries CFI that lets the unwinder step
// from the handler back into the interrupted frame.
#include <csignal>
#include <cstdint>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"

namespace qel {

namespace {

// x87 control word: IM, ZM, OM unmasked; DM, UM, PM masked; 53-bit precision;
// round to nearest.
constexpr std::uint16_t kArmedX87 = 0x272;
// All exceptions masked, 64-bit precision, round to nearest.
constexpr std::uint16_t kDefaultX87 = 0x37F;
// MXCSR: IM, ZM, OM unmasked; DM, UM, PM masked; denormals-are-zero on.
constexpr std::uint32_t kArmedMxcsr = 0x1940;
// MXCSR: everything masked, DAZ and FTZ off, flags clear.
constexpr std::uint32_t kDefaultMxcsr = 0x1F80;

}  // namespace

void SetLynFpuStates() {
  std::uint16_t cw = kArmedX87;
  std::uint32_t csr = kArmedMxcsr;
  // FNINIT drops any pending x87 exception before the traps are opened.
  __asm__ __volatile__(
      "fninit\n\t"
      "fldcw %0\n\t"
      "ldmxcsr %1"
      :
      : "m"(cw), "m"(csr)
      : "memory");
}

void ResetFpuStates() {
  std::uint16_t cw = kDefaultX87;
  std::uint32_t csr = kDefaultMxcsr;
  __asm__ __volatile__(
      "fwait\n\t"
      "fnclex\n\t"
      "fldcw %0\n\t"
      "ldmxcsr %1"
      :
      : "m"(cw), "m"(csr)
      : "memory");
}

void LynSigfpeHandler(int, siginfo_t* info, void*) {
  // The handler leaves by an exception and never returns to the kernel's
  // signal frame, so SIGFPE must be unblocked by hand.
  sigset_t set;
  sigemptyset(&set);
  sigaddset(&set, SIGFPE);
  sigprocmask(SIG_UNBLOCK, &set, nullptr);

  // Linux enters the handler with a fresh floating-point state; re-arm before
  // the exception object is made so that the armed state holds while it
  // travels.
  switch (info->si_code) {
    case FPE_FLTDIV:
      SetLynFpuStates();
      throw std::runtime_error("Float exception: divide by zero.");
    case FPE_FLTOVF:
      SetLynFpuStates();
      throw std::overflow_error("Float exception: overflow.");
    case FPE_FLTRES:
      SetLynFpuStates();
      throw std::invalid_argument("Float exception: inexact (bug).");
    case FPE_FLTINV:
      SetLynFpuStates();
      throw std::invalid_argument("Float exception: invalid_argument.");
    case FPE_INTDIV:
      throw std::runtime_error("Runtime exception: integer division by zero.");
    default:
      // Underflow, subnormal operand and anything else: masked in the armed
      // state, so nothing to report.
      return;
  }
}

int RegisterLynSigfpeHandler() {
  struct sigaction action = {};
  action.sa_sigaction = LynSigfpeHandler;
  sigemptyset(&action.sa_mask);
  action.sa_flags = SA_SIGINFO;
  if (sigaction(SIGFPE, &action, nullptr) != 0) return qelFailSignalHandler;
  ResetFpuStates();
  return qelOk;
}

}  // namespace qel
