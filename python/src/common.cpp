// Argument conversion, the call frame and result objects of the Python
// module.
#include "common.h"

#include <algorithm>

namespace qelpy {

namespace {

std::string dtypeName(const py::array& a) {
  return py::str(a.dtype()).cast<std::string>();
}

// The numbers of a numeric array as float64, or a TypeError. Strings,
// objects, complex and booleans are refused: silently reading True as 1.0
// or dropping an imaginary part would hide a mistake of the caller.
Doubles asDoubles(const py::array& a, const char* name) {
  const char kind = a.dtype().kind();
  if (kind != 'f' && kind != 'i' && kind != 'u') {
    throw py::type_error(std::string(name) + " must hold numbers (int or float), not dtype " +
                         dtypeName(a));
  }
  return Doubles::ensure(a);
}

// Element-wise retry after an exception escaped an array form: each element
// on its own, NaN where the library still refuses.
void guardedOneByOne(const ScalarFn& one, double* out, const double* in, std::size_t n) {
  for (std::size_t i = 0; i < n; ++i) {
    const double v = in[i];
    try {
      out[i] = one(v);
    } catch (const std::exception&) {
      qel::ResetFpuStates();
      out[i] = kNaN;
    }
  }
}

// The array form over n values; where an exception escapes it, the values
// are computed one by one instead. In place (dst == src) the library has
// overwritten part of the input by then, so the input goes through in
// chunks, each saved before its call.
void evaluateInto(const ScalarFn& one, const ArrayFn& many, double* dst, const double* src,
                  std::size_t n) {
  const std::size_t chunk = dst == src ? 4096 : std::max<std::size_t>(n, 1);
  std::vector<double> saved;
  for (std::size_t start = 0; start < n; start += chunk) {
    const std::size_t m = std::min(chunk, n - start);
    const double* in = src + start;
    if (dst == src) {
      saved.assign(in, in + m);
      in = saved.data();
    }
    try {
      many(dst + start, in, m);
    } catch (const std::exception&) {
      qel::ResetFpuStates();
      guardedOneByOne(one, dst + start, in, m);
    }
  }
}

// The output of an evaluation: a new array of the input's shape, or the
// caller's `out` after checking that the library can write into it.
py::array_t<double> outputFor(const Doubles& in, py::handle out) {
  std::vector<py::ssize_t> shape(in.shape(), in.shape() + in.ndim());
  if (out.is_none()) return py::array_t<double>(shape);
  if (!py::isinstance<py::array>(out)) throw py::type_error("out must be a numpy array");
  py::array o = py::reinterpret_borrow<py::array>(out);
  if (!o.dtype().is(py::dtype::of<double>())) {
    throw py::type_error("out must have dtype float64, not " + dtypeName(o));
  }
  if (!(o.flags() & py::array::c_style) || !o.writeable()) {
    throw py::value_error("out must be C-contiguous and writeable");
  }
  if (std::vector<py::ssize_t>(o.shape(), o.shape() + o.ndim()) != shape) {
    throw py::value_error("out must have the shape of the input");
  }
  return py::reinterpret_borrow<py::array_t<double>>(out);
}

}  // namespace

bool isScalar(py::handle obj) {
  if (PyFloat_Check(obj.ptr()) || PyLong_Check(obj.ptr())) return true;
  if (py::isinstance<py::array>(obj)) return py::reinterpret_borrow<py::array>(obj).ndim() == 0;
  static auto* generic = new py::object(py::module_::import("numpy").attr("generic"));
  return py::isinstance(obj, *generic);
}

Doubles numbers(py::handle obj, const char* name) {
  if (obj.is_none()) throw py::type_error(std::string(name) + " must be numbers, not None");
  py::array a = py::array::ensure(obj);
  if (!a) throw py::type_error(std::string(name) + " must be numbers");
  return asDoubles(a, name);
}

Doubles column(py::handle obj, const char* name) {
  Doubles a = numbers(obj, name);
  if (a.ndim() != 1) {
    throw py::value_error(std::string(name) + " must be one-dimensional, not " +
                          std::to_string(a.ndim()) + "-dimensional");
  }
  if (static_cast<unsigned long long>(a.size()) > std::numeric_limits<unsigned>::max()) {
    throw py::value_error(std::string(name) + " has more than 2^32 - 1 elements");
  }
  return a;
}

std::vector<Doubles> columns(py::handle obj, const char* name, std::size_t minimum) {
  std::vector<Doubles> out;
  if (py::isinstance<py::array>(obj)) {
    py::array a = py::reinterpret_borrow<py::array>(obj);
    if (a.ndim() != 2) throw py::value_error(std::string(name) + " must be two-dimensional");
    for (py::ssize_t r = 0; r < a.shape(0); ++r) out.push_back(column(a[py::int_(r)], name));
  } else if (py::isinstance<py::sequence>(obj) && !py::isinstance<py::str>(obj)) {
    for (py::handle item : obj) out.push_back(column(item, name));
  } else {
    throw py::type_error(std::string(name) + " must be a sequence of arrays");
  }
  if (out.size() < minimum) {
    throw py::value_error(std::string(name) + " needs at least " + std::to_string(minimum) +
                          " groups");
  }
  return out;
}

unsigned count(const Doubles& a) {
  return static_cast<unsigned>(a.size());
}

py::object evaluate(py::handle x, py::handle out, const ScalarFn& one, const ArrayFn& many) {
  if (out.is_none() && isScalar(x)) {
    const double v = numbers(x, "x").data()[0];
    double r = kNaN;
    {
      py::gil_scoped_release release;
      guardedOneByOne(one, &r, &v, 1);
    }
    return py::float_(r);
  }
  Doubles in = numbers(x, "x");
  py::array_t<double> result = outputFor(in, out);
  const double* src = in.data();
  double* dst = result.mutable_data();
  const std::size_t n = static_cast<std::size_t>(in.size());
  {
    py::gil_scoped_release release;
    evaluateInto(one, many, dst, src, n);
  }
  return std::move(result);
}

ArrayFn loopOver(ScalarFn one) {
  return [one](double* out, const double* in, unsigned long n) {
    for (unsigned long i = 0; i < n; ++i) out[i] = one(in[i]);
  };
}

void check(int code) {
  if (code >= 20000) throw CodeError(code);
}

qel::AlternativeHypothesis alternativeOf(const std::string& name) {
  if (name == "two-sided") return qel::kAlternativeNotEqual;
  if (name == "less") return qel::kAlternativeLess;
  if (name == "greater") return qel::kAlternativeGreater;
  throw py::value_error("alternative must be 'less', 'greater' or 'two-sided', not '" + name + "'");
}

qel::IntervalType intervalOf(py::handle interval, qel::AlternativeHypothesis alternative) {
  if (interval.is_none()) {
    if (alternative == qel::kAlternativeGreater) return qel::kIntervalLowerBound;
    if (alternative == qel::kAlternativeLess) return qel::kIntervalUpperBound;
    return qel::kIntervalTwoSided;
  }
  const std::string name = py::str(interval);
  if (name == "two-sided") return qel::kIntervalTwoSided;
  if (name == "lower") return qel::kIntervalLowerBound;
  if (name == "upper") return qel::kIntervalUpperBound;
  throw py::value_error("interval must be 'two-sided', 'lower' or 'upper', not '" + name + "'");
}

double confidenceOf(double confidence) {
  if (!(confidence > 0.0 && confidence < 1.0)) {
    throw py::value_error("confidence must lie in (0, 1)");
  }
  return confidence;
}

py::object result(const char* type, const Fields& fields) {
  static auto* make = new py::object(py::module_::import("qel._results").attr("make"));
  py::dict d;
  for (const auto& f : fields) d[f.first] = f.second;
  return (*make)(type, d);
}

py::array_t<double> toArray(const double* values, std::size_t n) {
  py::array_t<double> a(static_cast<py::ssize_t>(n));
  std::copy(values, values + n, a.mutable_data());
  return a;
}

void registerErrorTranslator() {
  py::register_exception_translator([](std::exception_ptr p) {
    try {
      if (p) std::rethrow_exception(p);
    } catch (const CodeError& e) {
      py::object err = py::module_::import("qel._errors").attr("from_code")(e.code, e.detail);
      PyErr_SetObject(reinterpret_cast<PyObject*>(Py_TYPE(err.ptr())), err.ptr());
    } catch (const TrapError& e) {
      py::object err = py::module_::import("qel._errors").attr("trap")(e.what());
      PyErr_SetObject(reinterpret_cast<PyObject*>(Py_TYPE(err.ptr())), err.ptr());
    }
  });
}

}  // namespace qelpy
