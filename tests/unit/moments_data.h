// The data sets of the moment reference values, rebuilt bit for bit from the
// same 32-bit congruential generator as tools/reference/gen_moments.py.
#ifndef QEL_TESTS_MOMENTS_DATA_H
#define QEL_TESTS_MOMENTS_DATA_H

#include <cmath>
#include <cstdint>
#include <string>
#include <vector>

namespace qeltest {

// s' = 1664525 s + 1013904223 mod 2^32 (Numerical Recipes).
class Lcg {
 public:
  explicit Lcg(std::uint32_t seed) : s_(seed) {}
  std::uint32_t operator()() {
    s_ = 1664525u * s_ + 1013904223u;
    return s_;
  }

 private:
  std::uint32_t s_;
};

// 1e9 + k 2^-23 with k = s >> 12: a large offset over small noise.
inline std::vector<double> offsetData(unsigned n, std::uint32_t seed) {
  Lcg g(seed);
  std::vector<double> x(n);
  for (auto& v : x) v = 1e9 + std::ldexp(g() >> 12, -23);
  return x;
}

// 1e6 + (s >> 22)^2 2^-20: right-skewed noise on an offset.
inline std::vector<double> skewedData(unsigned n, std::uint32_t seed) {
  Lcg g(seed);
  std::vector<double> x(n);
  for (auto& v : x) {
    const double u = g() >> 22;
    v = 1e6 + std::ldexp(u * u, -20);
  }
  return x;
}

// +-(2^20 + m) 2^(e-20) with e in [-40, 40]: values over 24 decades.
inline std::vector<double> magnitudeData(unsigned n, std::uint32_t seed) {
  Lcg g(seed);
  std::vector<double> x(n);
  for (auto& v : x) {
    const std::uint32_t s1 = g();
    const std::uint32_t s2 = g();
    const int e = static_cast<int>((s1 >> 8) % 81) - 40;
    const double magnitude = std::ldexp((1u << 20) + (s2 >> 12), e - 20);
    v = (s1 >> 31) ? -magnitude : magnitude;
  }
  return x;
}

// x = 1e9 + k 2^-23, y = 5e8 - k 2^-22 + v 2^-24: strongly negatively
// correlated columns far from zero.
inline void pairData(unsigned n, std::uint32_t seed, std::vector<double>& x,
                     std::vector<double>& y) {
  Lcg g(seed);
  x.resize(n);
  y.resize(n);
  for (unsigned i = 0; i < n; ++i) {
    const double k = g() >> 12;
    const double v = g() >> 12;
    x[i] = 1e9 + std::ldexp(k, -23);
    y[i] = 5e8 - std::ldexp(k, -22) + std::ldexp(v, -24);
  }
}

// Small integers with many ties.
inline void tiesData(unsigned n, std::uint32_t seed, std::vector<double>& x,
                     std::vector<double>& y) {
  Lcg g(seed);
  x.resize(n);
  y.resize(n);
  for (unsigned i = 0; i < n; ++i) {
    x[i] = (g() >> 16) % 20;
    y[i] = x[i] + (g() >> 16) % 7;
  }
}

}  // namespace qeltest

#endif
