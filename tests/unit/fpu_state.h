// Reading the floating-point control registers back, for tests of the frame.
#ifndef QEL_TESTS_FPU_STATE_H
#define QEL_TESTS_FPU_STATE_H

#include <cstdint>

namespace qeltest {

inline std::uint16_t x87ControlWord() {
  std::uint16_t cw;
  __asm__ __volatile__("fnstcw %0" : "=m"(cw));
  return cw;
}

inline std::uint32_t mxcsr() {
  std::uint32_t csr;
  __asm__ __volatile__("stmxcsr %0" : "=m"(csr));
  return csr;
}

constexpr std::uint16_t kArmedX87 = 0x272;
constexpr std::uint16_t kDefaultX87 = 0x37F;
constexpr std::uint32_t kArmedMxcsr = 0x1940;
constexpr std::uint32_t kDefaultMxcsr = 0x1F80;

inline bool isDefaultState() {
  return x87ControlWord() == kDefaultX87 && mxcsr() == kDefaultMxcsr;
}
inline bool isArmedState() {
  // Sticky flags (the low six bits) may be set by masked underflow or
  // precision results; the control bits must be exactly the armed ones.
  return x87ControlWord() == kArmedX87 && (mxcsr() & ~0x3Fu) == kArmedMxcsr;
}

}  // namespace qeltest

#endif
