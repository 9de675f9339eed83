// Error state of the high-accuracy (ELV) routines: the process-wide status
// variables, the texts of the codes, and the frame every routine runs in.
//
// A routine opens its run with ELVstartup and closes it with ELVexit. Because
// routines call one another, an inner startup wipes the caller's code; the
// closing rule ("F" always stores, anything else only a larger code) lets an
// outer routine that ends normally keep an inner failure standing.
#include <qel/elv.h>

#include <cstddef>
#include <cstdio>

#include "utilities/elv/limits.h"
#include "utilities/elv/thread_status.h"

extern "C" {

int ELVerrno = 0;
int64_t ELVmethod = 0;
char ELVroutine[31] = {0};
int64_t ELVsteps1 = 0;
int64_t ELVsteps2 = 0;
int64_t ELVsteps3 = 0;
int64_t ELVsteps4 = 0;

const char* const ELVerrlist[5] = {
    "no errors detected",
    "partial loss of significance (result set to 0)",
    "argument out of admissable range",
    "invalid combination of parameters",
    "internal failure of algorithm",
};

}  // extern "C"

namespace {

// The calling thread's code: ELVerrno's twin that no other thread writes.
// Initial-exec TLS (limits.h): every run opens and closes on it.
thread_local int threadErrno QEL_FAST_TLS = 0;

// The name as strncpy would store it (at most 30 bytes, the rest zero), by
// hand: the names are short literals, and the library call with its
// padding cost more than the routine's own work on a short series.
void storeRoutineName(const char* name) {
  constexpr std::size_t kUsable = sizeof ELVroutine - 1;
  std::size_t i = 0;
  if (name != nullptr) {
    for (; i < kUsable && name[i] != '\0'; ++i) ELVroutine[i] = name[i];
  }
  for (; i < sizeof ELVroutine; ++i) ELVroutine[i] = '\0';
}

}  // namespace

extern "C" {

void ELVstartup(const char* name) {
  ELVerrno = 0;
  threadErrno = 0;
  storeRoutineName(name);
}

void ELVexit(const char* name, int code, char mode) {
  if (mode == 'F' || code > threadErrno) {
    threadErrno = code;
    ELVerrno = code;
    storeRoutineName(name);
  }
}

// No range check: the code must be one of 0 to 4.
const char* ELVstrerror(int code) {
  return ELVerrlist[code];
}

void ELVperror(const char* prefix) {
  const char* text = (ELVerrno >= 0 && ELVerrno <= 4) ? ELVerrlist[ELVerrno] : "";
  if (prefix == nullptr) {
    std::fprintf(stderr, "%s (issued from: %s)\n", text, ELVroutine);
  } else {
    std::fprintf(stderr, "%s: %s (issued from: %s)\n", prefix, text, ELVroutine);
  }
}

}  // extern "C"

namespace qel {
namespace elv {

int threadStatus() {
  return threadErrno;
}

void storeStatus(int code) {
  threadErrno = code;
  ELVerrno = code;
}

}  // namespace elv
}  // namespace qel
