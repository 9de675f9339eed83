// Argument checks and result objects shared by the designs of qel.power.
#include "arguments.h"

#include <cmath>

#include "utilities/LYNBasicTypes.h"

namespace qelpy {
namespace power {

namespace {

std::string named(const char* name, const char* text) {
  return std::string(name) + text;
}

}  // namespace

std::vector<double> numberList(py::handle obj, const char* name) {
  const Doubles a = numbers(obj, name);
  if (a.ndim() > 1)
    throw py::value_error(named(name, " must be a number or a one-dimensional list"));
  if (a.size() == 0) throw py::value_error(named(name, " must not be empty"));
  std::vector<double> out(a.data(), a.data() + a.size());
  for (double x : out)
    if (!std::isfinite(x)) throw py::value_error(named(name, " must hold finite numbers"));
  return out;
}

std::vector<int> countList(py::handle obj, const char* name, int lowest) {
  std::vector<int> out;
  for (double x : numberList(obj, name)) {
    if (!(x >= lowest && x <= 2147483647.0) || x != std::floor(x)) {
      throw py::value_error(named(name, " takes whole numbers from ") + std::to_string(lowest));
    }
    out.push_back(static_cast<int>(x));
  }
  return out;
}

int countOption(py::handle obj, const char* name, int lowest, int fallback) {
  if (obj.is_none()) return fallback;
  if (!isScalar(obj)) throw py::type_error(named(name, " must be one whole number"));
  return countList(obj, name, lowest)[0];
}

double positive(double x, const char* name) {
  if (!(x > 0.0) || !std::isfinite(x)) throw py::value_error(named(name, " must be positive"));
  return x;
}

double level(double x, const char* name) {
  if (!(x > 0.0 && x < 1.0)) throw py::value_error(named(name, " must lie in (0, 1)"));
  return x;
}

double finite(double x, const char* name) {
  if (!std::isfinite(x)) throw py::value_error(named(name, " must be a finite number"));
  return x;
}

void requireGiven(const Given& g, int wanted, const char* names) {
  if (g.count() != wanted) {
    throw py::type_error(std::string("give exactly ") + (wanted == 2 ? "two" : "three") + " of " +
                         names);
  }
}

void checkPowers(const std::vector<double>& powers, double alpha, bool belowOne) {
  for (double p : powers) {
    if (!(p > alpha)) throw py::value_error("every power must be above alpha");
    if (belowOne && !(p < 1.0)) throw py::value_error("every power must be below 1");
  }
}

Lists readLists(py::handle n, py::handle effect, py::handle power, double alpha,
                const std::string& alternative) {
  Lists l;
  l.given.n = !n.is_none();
  l.given.effect = !effect.is_none();
  l.given.power = !power.is_none();
  requireGiven(l.given, 2, "n, effect and power");
  l.alpha = level(alpha, "alpha");
  l.alternative = alternativeOf(alternative);
  if (l.given.n) l.n = countList(n, "n", 1);
  if (l.given.effect) l.effect = numberList(effect, "effect");
  if (l.given.power) l.power = numberList(power, "power");
  checkPowers(l.power, l.alpha, false);
  return l;
}

void setUp(qel::CmCmndPower& command, const Lists& lists, bool twoSample) {
  command.mSetLevel(lists.alpha);
  command.mSetAlternative(lists.alternative);
  command.mSetTwoSample(twoSample);
  if (lists.given.n) command.mSetSampleSizes(lists.n);
  if (lists.given.effect) command.mSetEffects(lists.effect);
  if (lists.given.power) command.mSetPowers(lists.power);
}

double shown(double x) {
  return qel::mIsNumericMissing(x) ? kNaN : x;
}

py::object countOrNone(int n) {
  return n < 0 ? py::object(py::none()) : py::object(py::int_(n));
}

std::vector<Row> rowsOf(const qel::CmCmndPower& command, bool solvedN) {
  std::vector<Row> rows;
  const auto& n = command.mGetResultSampleSizes();
  for (std::size_t i = 0; i < n.size(); ++i) {
    const double target = solvedN ? command.mGetTargetPowers()[i] : kNaN;
    rows.push_back({n[i], shown(command.mGetResultEffects()[i]),
                    shown(command.mGetResultPowers()[i]), shown(target)});
  }
  return rows;
}

py::object results(py::list rows, const char* solved, py::object extents) {
  static auto* cls = new py::object(py::module_::import("qel.power").attr("Results"));
  return (*cls)(rows, solved, extents);
}

py::object resultsOf(const Solved& s, const Given& g) {
  py::list rows;
  for (const Row& r : s.rows) {
    rows.append(result("PowerResult", {{"n", countOrNone(r.n)},
                                       {"effect", py::float_(r.effect)},
                                       {"power", py::float_(r.power)},
                                       {"target", py::float_(r.target)}}));
  }
  const char* solved = !g.effect ? "effect" : !g.power ? "power" : "n";
  py::object extents = py::none();
  if (s.hasExtents) extents = py::make_tuple(s.low, s.high);
  return results(rows, solved, extents);
}

}  // namespace power
}  // namespace qelpy
