// The extension module qel._power: the power and sample-size commands,
// linked from the static library (they are not part of libqel.so's exported
// surface). The package module qel.power re-exports it.
#include "arguments.h"

PYBIND11_MODULE(_power, m) {
  m.doc() = "libqel's power and sample-size commands, as qelcalc power offers them.";
  // This module carries its own copy of the library's internals, including
  // the SIGFPE handler; the handler only turns a trap into a standard C++
  // exception, so either copy serves every caller.
  if (qel::RegisterLynSigfpeHandler() != qel::qelOk) {
    throw std::runtime_error("qel.power: the SIGFPE handler could not be installed");
  }
  qelpy::registerErrorTranslator();
  qelpy::power::registerMeans(m);
  qelpy::power::registerRates(m);
  qelpy::power::registerFactorial(m);
}
