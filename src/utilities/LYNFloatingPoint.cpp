// The floating-point call frame: the armed and default states of the x87 unit
// and of SSE (MXCSR; the switches are in LYNFloatingPoint.h), and the SIGFPE handler that turns a
// trap into a C++ exception at the faulting instruction.
//
// Throwing from the handler works because the library is compiled with
// -fnon-call-exceptions (every trapping instruction has unwind information)
// and the kernel's signal trampoline carries CFI that lets the unwinder step
// from the handler back into the interrupted frame.
#include "utilities/LYNFloatingPoint.h"

#include <csignal>
#include <stdexcept>

#include "utilities/LYNBasicTypes.h"

namespace qel {

namespace fpu {

void dropX87Flags() {
  __asm__ __volatile__("fnclex" : : : "memory");
}

void deliverAndDropX87Flags() {
  __asm__ __volatile__(
      "fwait\n\t"
      "fnclex"
      :
      :
      : "memory");
}

}  // namespace fpu

void SetLynFpuStates() {
  fpu::arm();
}

void ResetFpuStates() {
  fpu::reset();
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
