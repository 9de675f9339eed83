// Two doubles in one SSE2 register through the GCC vector extension. Every
// lane rounds exactly as the scalar operation would, so loops written with
// pairs give the same results as their scalar form; they only let the
// compiler issue packed instructions at -O2.
#ifndef QEL_SRC_UTILITIES_MATRIXLIBRARY_SIMD_PAIR_H
#define QEL_SRC_UTILITIES_MATRIXLIBRARY_SIMD_PAIR_H

#include <cstring>

namespace qel {
namespace simd {

typedef double Pair __attribute__((vector_size(16)));

inline Pair load(const double* p) {
  Pair x;
  std::memcpy(&x, p, sizeof x);
  return x;
}

inline void store(double* p, Pair x) {
  std::memcpy(p, &x, sizeof x);
}

inline Pair broadcast(double a) {
  return Pair{a, a};
}

// y[k] -= a x[k] for k below count.
inline void subtractMultiple(double* y, double a, const double* x, int count) {
  const Pair pa = broadcast(a);
  int k = 0;
  for (; k + 4 <= count; k += 4) {
    store(y + k, load(y + k) - pa * load(x + k));
    store(y + k + 2, load(y + k + 2) - pa * load(x + k + 2));
  }
  for (; k < count; ++k) y[k] -= a * x[k];
}

}  // namespace simd
}  // namespace qel

#endif
