// Arguments and rows of the power functions of qel.power: the given lists
// (a number or a one-dimensional sequence), the design's scalar options,
// and the rows a command computed, read back as plain numbers so that the
// Python objects are made after the GIL is taken again.
#ifndef QEL_PYTHON_POWER_ARGUMENTS_H
#define QEL_PYTHON_POWER_ARGUMENTS_H

#include <string>
#include <vector>

#include "../src/common.h"
#include "basic_statistics/Power.h"

namespace qelpy {
namespace power {

// A list of finite numbers: one number or a non-empty one-dimensional
// sequence; TypeError for other types, ValueError for other shapes or values.
std::vector<double> numberList(py::handle obj, const char* name);
// A list of whole numbers from `lowest` up to 2^31 - 1.
std::vector<int> countList(py::handle obj, const char* name, int lowest);
// One whole number from `lowest`; `fallback` for None.
int countOption(py::handle obj, const char* name, int lowest, int fallback);

// A finite positive number, a level in (0, 1), a finite number.
double positive(double x, const char* name);
double level(double x, const char* name);
double finite(double x, const char* name);

// Which lists of a request are given: exactly `wanted` of them (TypeError
// otherwise, naming them), the powers above alpha (and below 1 when
// `belowOne`).
struct Given {
  bool n = false, effect = false, power = false, extra = false;
  int count() const { return n + effect + power + extra; }
};
void requireGiven(const Given& g, int wanted, const char* names);
void checkPowers(const std::vector<double>& powers, double alpha, bool belowOne);

// A NaN for the library's missing value.
double shown(double x);
// A count as Python sees it: None for a count that was not computed.
py::object countOrNone(int n);

// One row "n effect power target" of a design with one sample size.
struct Row {
  int n;
  double effect, power, target;
};
// The rows and the plot extents of a solved request.
struct Solved {
  std::vector<Row> rows;
  bool hasExtents = false;
  double low = kNaN, high = kNaN;
};
// The rows of a command after mComputeAndStore; the target only when the
// sample sizes were solved.
std::vector<Row> rowsOf(const qel::CmCmndPower& command, bool solvedN);

// The lists, alpha and alternative of a design with one sample size: two
// of n, effect and power given, checked before any command is made.
struct Lists {
  Given given;
  std::vector<int> n;
  std::vector<double> effect, power;
  double alpha = 0.05;
  qel::EAlternative alternative = qel::kAlternativeNotEqual;
};
Lists readLists(py::handle n, py::handle effect, py::handle power, double alpha,
                const std::string& alternative);
// The lists and common parameters set on a command.
void setUp(qel::CmCmndPower& command, const Lists& lists, bool twoSample);

// Computes the rows of a command set up from `lists`, and its plot extents
// when asked for.
template <class Command>
Solved finish(Command& command, const Lists& lists, bool extents) {
  command.mComputeAndStore();
  Solved s;
  s.rows = rowsOf(command, !lists.given.n);
  if (extents) {
    double low = 0.0, high = 0.0;
    command.mGetSuggestedXMinXMax(command.mGetResultEffects(), &low, &high);
    s.hasExtents = true;
    s.low = shown(low);
    s.high = shown(high);
  }
  return s;
}

// qel.power.Results: the list of result objects, with the name of the
// solved quantity and the extents (None unless asked for).
py::object results(py::list rows, const char* solved, py::object extents);
py::object resultsOf(const Solved& s, const Given& g);

// Registration of the designs.
void registerMeans(py::module_& m);
void registerRates(py::module_& m);
void registerFactorial(py::module_& m);

}  // namespace power
}  // namespace qelpy

#endif
