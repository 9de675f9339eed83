// The distribution families as submodules qel.<family> (pdf, cdf, inv,
// P-values and critical values), the discrete law on given values, the
// studentized range and the range of normal samples.
#include <qel/distributions.h>

#include "common.h"

namespace qelpy {

namespace {

void registerFamilies(py::module_& parent) {
#include "distributions_table.inc"
}

// Values and probabilities of the discrete law: two columns of one length.
struct DiscreteLaw {
  DiscreteLaw(py::handle v, py::handle p)
      : values(column(v, "values")), probabilities(column(p, "probabilities")) {
    if (values.size() != probabilities.size()) {
      throw py::value_error("values and probabilities must have the same length");
    }
    if (values.size() > std::numeric_limits<int>::max()) {
      throw py::value_error("too many values");
    }
  }
  int size() const { return static_cast<int>(values.size()); }
  Doubles values;
  Doubles probabilities;
};

void registerDiscrete(py::module_& parent) {
  py::module_ m =
      parent.def_submodule("discrete",
                           "Discrete law on given values with given probabilities; the first "
                           "occurrence of a repeated value wins.");
  m.def(
      "pdf",
      [](py::handle x, py::handle values, py::handle probabilities, py::handle out) {
        DiscreteLaw law(values, probabilities);
        const double* v = law.values.data();
        const double* p = law.probabilities.data();
        const int n = law.size();
        return evaluate(
            x, out, [=](double a) { return qel::DiscretePdf(a, v, p, n); },
            [=](double* o, const double* i, unsigned long c) {
              qel::DiscretePdf(o, i, c, v, p, n);
            });
      },
      py::arg("x"), py::arg("values"), py::arg("probabilities"), py::kw_only(),
      py::arg("out") = py::none());
  m.def(
      "cdf",
      [](py::handle x, py::handle values, py::handle probabilities, bool upper, py::handle out) {
        DiscreteLaw law(values, probabilities);
        const double* v = law.values.data();
        const double* p = law.probabilities.data();
        const int n = law.size();
        return evaluate(
            x, out, [=](double a) { return qel::DiscreteCdf(a, v, p, n, upper); },
            [=](double* o, const double* i, unsigned long c) {
              qel::DiscreteCdf(o, i, c, v, p, n, upper);
            });
      },
      py::arg("x"), py::arg("values"), py::arg("probabilities"), py::kw_only(),
      py::arg("upper") = false, py::arg("out") = py::none());
  m.def(
      "inv",
      [](py::handle q, py::handle values, py::handle probabilities, py::handle out) {
        DiscreteLaw law(values, probabilities);
        const double* v = law.values.data();
        const double* p = law.probabilities.data();
        const int n = law.size();
        return evaluate(
            q, out, [=](double a) { return qel::DiscreteInvCdf(a, v, p, n); },
            [=](double* o, const double* i, unsigned long c) {
              qel::DiscreteInvCdf(o, i, c, v, p, n);
            });
      },
      py::arg("p"), py::arg("values"), py::arg("probabilities"), py::kw_only(),
      py::arg("out") = py::none());
}

// The library answers its missing value for arguments it refuses; Python
// sees NaN.
double missingAsNaN(double v) {
  return qel::IsResultNA(v) ? kNaN : v;
}

void registerRanges(py::module_& parent) {
  py::module_ s = parent.def_submodule(
      "studentized_range", "Studentized range (Tukey) of k means on df degrees of freedom.");
  s.def(
      "pvalue",
      [](py::handle q, int k, double df) {
        auto one = [=](double v) { return missingAsNaN(qel::GetStudentizedRangePValue(v, k, df)); };
        return evaluate(q, py::none(), one, loopOver(one));
      },
      py::arg("q"), py::arg("k"), py::arg("df"));
  s.def(
      "crit",
      [](py::handle alpha, int k, double df) {
        auto one = [=](double v) {
          return missingAsNaN(qel::GetStudentizedRangeCritValue(v, k, df));
        };
        return evaluate(alpha, py::none(), one, loopOver(one));
      },
      py::arg("alpha"), py::arg("k"), py::arg("df"));
  s.def("is_possible", &qel::IsStudentizedRangePossible, py::arg("k"), py::arg("df"),
        py::arg("alpha"), "Whether the critical value at (k, df, alpha) is trusted.");
  s.def("is_maximum_possible", &qel::IsStudentizedMaximumPossible, py::arg("k"), py::arg("df"),
        py::arg("alpha"));
  s.def("is_maximum_modulus_possible", &qel::IsStudentizedMaximumModulusPossible, py::arg("k"),
        py::arg("df"), py::arg("alpha"));

  py::module_ r =
      parent.def_submodule("normal_range", "Range of k independent standard normal variables.");
  r.def(
      "cdf",
      [](py::handle x, int k, bool upper, py::handle out) {
        auto one = [=](double v) { return qel::v0::NormalRangeCdf(v, k, upper); };
        return evaluate(x, out, one, loopOver(one));
      },
      py::arg("x"), py::arg("k"), py::kw_only(), py::arg("upper") = false,
      py::arg("out") = py::none());
  r.def(
      "inv",
      [](py::handle p, int k, py::handle out) {
        auto one = [=](double v) { return qel::v0::NormalRangeInvCdf(v, k); };
        return evaluate(p, out, one, loopOver(one));
      },
      py::arg("p"), py::arg("k"), py::kw_only(), py::arg("out") = py::none());
}

}  // namespace

void registerDistributions(py::module_& m) {
  registerFamilies(m);
  registerDiscrete(m);
  registerRanges(m);
}

}  // namespace qelpy
