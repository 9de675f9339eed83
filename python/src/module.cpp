// The extension module qel._qel; the package qel (python/qel) re-exports it.
#include "common.h"

PYBIND11_MODULE(_qel, m) {
  m.doc() =
      "libqel: distributions with accurate far tails, sampling, descriptive "
      "statistics, tests and intervals, contingency tables.";
  // A floating-point trap inside the library becomes a C++ exception that
  // the kernels catch; without the handler it would end the interpreter.
  if (qel::RegisterLynSigfpeHandler() != qel::qelOk) {
    throw std::runtime_error("qel: the SIGFPE handler could not be installed");
  }
  qelpy::registerErrorTranslator();
  qelpy::registerDistributions(m);
  qelpy::registerSampler(m);
  qelpy::registerDescriptive(m);
  qelpy::registerLocationTests(m);
  qelpy::registerRankTests(m);
  qelpy::registerProportionVarianceTests(m);
  qelpy::registerTables(m);
  qelpy::registerFits(m);
}
