// Links against the installed libqel and checks one answer from each side of
// the frame: an armed-frame family and the handler registration.
#include <qel/qel.h>

#include <cmath>
#include <cstdio>

int main() {
  if (qel::RegisterLynSigfpeHandler() != qel::qelOk) return 1;
  const double p = qel::LogisticCdf(0.0, 0.0, 1.0, true);
  const double q = qel::CauchyInvCdf(0.75, 0.0, 1.0);
  if (p != 0.5 || std::fabs(q - 1.0) > 1e-15 || !qel::IsResultNA(qel::CauchyInvCdf(0.0, 0, 1))) {
    std::printf("consumer: wrong answers %g %g\n", p, q);
    return 1;
  }
  std::printf("consumer: find_package(qel) works\n");
  return 0;
}
