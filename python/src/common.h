// Shared machinery of the Python module: conversion of arguments to the
// library's array forms, the GIL-free call frame, message codes as Python
// exceptions and the small result objects.
#ifndef QEL_PYTHON_COMMON_H
#define QEL_PYTHON_COMMON_H

#include <pybind11/numpy.h>
#include <pybind11/pybind11.h>
#include <qel/basic_types.h>

#include <cmath>
#include <functional>
#include <limits>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace qelpy {

namespace py = pybind11;

constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

// A C-contiguous float64 array: the caller's own buffer when it already is
// one, a converted copy otherwise.
using Doubles = py::array_t<double, py::array::c_style | py::array::forcecast>;

// A failure code of the library (20003 and above), raised in Python as
// qel.Error or the subclass of the code.
struct CodeError : std::exception {
  explicit CodeError(int c, std::string what = "") : code(c), detail(std::move(what)) {}
  const char* what() const noexcept override { return detail.c_str(); }
  int code;
  std::string detail;
};

// An exception that escaped the library (a floating-point trap no kernel
// expected): the thread's floating-point state has been reset.
struct TrapError : std::runtime_error {
  using std::runtime_error::runtime_error;
};

// Numbers of any shape (int, unsigned or float dtype; nested lists); a
// TypeError for other dtypes. `name` names the argument in messages.
Doubles numbers(py::handle obj, const char* name);
// One column of data: as numbers, and one-dimensional (ValueError
// otherwise) with fewer than 2^32 elements.
Doubles column(py::handle obj, const char* name);
// Several columns (a sequence of one-dimensional arrays, or the rows of a
// two-dimensional one); at least `minimum` of them.
std::vector<Doubles> columns(py::handle obj, const char* name, std::size_t minimum);
// The element count of a column as the library's unsigned count.
unsigned count(const Doubles& a);
// Whether a Python object is one number (not an array or a sequence).
bool isScalar(py::handle obj);

// Whether v is a whole number that fits in an int.
inline bool isWholeInt(double v) {
  return std::floor(v) == v && v >= std::numeric_limits<int>::min() &&
         v <= std::numeric_limits<int>::max();
}

// A distribution-style evaluation: a Python float for one number, otherwise
// a new float64 array of the input's shape (or the given `out`, which must
// be a writable C-contiguous float64 array of that shape and may be the
// input itself). The library runs without the GIL.
using ScalarFn = std::function<double(double)>;
using ArrayFn = std::function<void(double*, const double*, unsigned long)>;
py::object evaluate(py::handle x, py::handle out, const ScalarFn& one, const ArrayFn& many);
// An array form made of a scalar one, for functions the library offers on
// one number only.
ArrayFn loopOver(ScalarFn one);

// Runs f without the GIL. An exception from the library resets the
// thread's floating-point state and comes back as TrapError.
template <class F>
auto released(F&& f) -> decltype(f()) {
  py::gil_scoped_release release;
  try {
    return f();
  } catch (const CodeError&) {
    throw;
  } catch (const std::exception& e) {
    qel::ResetFpuStates();
    throw TrapError(e.what());
  }
}

// Raises CodeError for a failure code (20003 and above); warnings (10000 to
// 10004) and 0 pass and are reported in the result's `status`.
void check(int code);

// "less", "greater" or "two-sided" (ValueError otherwise).
qel::AlternativeHypothesis alternativeOf(const std::string& name);
// "two-sided", "lower" or "upper"; None follows the alternative (a bound
// below for "greater", above for "less"), as qelcalc does.
qel::IntervalType intervalOf(py::handle interval, qel::AlternativeHypothesis alternative);

// A confidence in (0, 1), a ValueError otherwise.
double confidenceOf(double confidence);

// A result object: qel.<type>(field=value, ...), fields in the given order.
using Fields = std::vector<std::pair<const char*, py::object>>;
py::object result(const char* type, const Fields& fields);
// A float64 array copied from n doubles.
py::array_t<double> toArray(const double* values, std::size_t n);

// Registration of each area.
void registerErrorTranslator();
void registerDistributions(py::module_& m);
void registerSampler(py::module_& m);
void registerDescriptive(py::module_& m);
void registerLocationTests(py::module_& m);
void registerRankTests(py::module_& m);
void registerProportionVarianceTests(py::module_& m);
void registerTables(py::module_& m);
void registerFits(py::module_& m);

}  // namespace qelpy

#endif
