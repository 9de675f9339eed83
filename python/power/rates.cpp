// qel.power for proportions, variances and Poisson rates, as `qelcalc
// power prop|variance|poisson`: effects are differences from the null
// proportion or the baseline rate (solved ones are written as proportions
// and rates), or ratios of variances (of standard deviations).
#include <cmath>
#include <string>

#include "arguments.h"
#include "basic_statistics/Power.h"
#include "utilities/LYNBasicTypes.h"

namespace qelpy {
namespace power {

namespace {

// base + e strictly inside (low, high) for every effect; the command's own
// rule, checked here so that no command is made for a bad request.
void checkEffects(const Lists& l, double base, double low, double high, const char* range) {
  for (double e : l.effect) {
    const double x = base + e;
    if (!(x > low && x < high)) throw py::value_error(std::string("every effect must ") + range);
  }
}

py::object proportion(py::object n, py::object effect, py::object power, double null, double alpha,
                      const std::string& alternative, bool twoSample, bool extents) {
  const Lists lists = readLists(n, effect, power, alpha, alternative);
  level(null, "null");
  checkEffects(lists, null, 0.0, 1.0, "put null + effect inside (0, 1)");
  const Solved s = released([&] {
    qel::CmCmndPowerProportion c;
    setUp(c, lists, twoSample);
    c.mSetNull(null);
    return finish(c, lists, extents);
  });
  return resultsOf(s, lists.given);
}

qel::ETestMethod methodOf(const std::string& method) {
  if (method == "chisq") return qel::kVarianceChiSquareOrF;
  if (method == "bonett") return qel::kVarianceBonett;
  if (method == "levene") return qel::kVarianceLevene;
  throw py::value_error("method must be 'chisq', 'bonett' or 'levene', not '" + method + "'");
}

py::object variance(py::object n, py::object effect, py::object power, const std::string& method,
                    double kurtosis, bool ratioSd, double alpha, const std::string& alternative,
                    bool twoSample, bool extents) {
  const Lists lists = readLists(n, effect, power, alpha, alternative);
  const qel::ETestMethod m = methodOf(method);
  finite(kurtosis, "kurtosis");
  checkEffects(lists, 0.0, 0.0, HUGE_VAL, "be a positive ratio");
  const Solved s = released([&] {
    qel::CmCmndVariance c;
    setUp(c, lists, twoSample);
    c.mSetTestMethod(m);
    c.mSetKurtosis(kurtosis);
    c.mSetRatioOfSigmas(ratioSd);
    return finish(c, lists, extents);
  });
  return resultsOf(s, lists.given);
}

py::object poisson(py::object n, py::object effect, py::object power, double rate,
                   py::object length, double alpha, const std::string& alternative, bool twoSample,
                   bool extents) {
  const Lists lists = readLists(n, effect, power, alpha, alternative);
  positive(rate, "rate");
  std::vector<double> lengths;
  if (!length.is_none()) {
    lengths = numberList(length, "length");
    for (double l : lengths) positive(l, "length");
    if (lengths.size() > 2) throw py::value_error("length takes one or two lengths");
  }
  checkEffects(lists, rate, 0.0, HUGE_VAL, "keep rate + effect positive");
  const Solved s = released([&] {
    qel::CmCmndPowerPoisson c;
    setUp(c, lists, twoSample);
    c.mSetRate(rate);
    if (!lengths.empty()) c.mSetLengths(lengths);
    return finish(c, lists, extents);
  });
  return resultsOf(s, lists.given);
}

const char* const kRule =
    "\n\nGive two of n, effect and power (a number or a list each); the third is "
    "solved for every pair, in qelcalc's row order (a two-sided effect search "
    "gives a row for each side). Returns qel.power.Results, a list of "
    "PowerResult(n, effect, power, target): n None where no size was found, NaN "
    "where nothing could be computed, target the power asked for when n is "
    "solved. extents=True also gives the x range of a power curve in "
    "Results.extents.";

}  // namespace

void registerRates(py::module_& m) {
  using py::arg;
  const auto none = py::none();
  m.def("proportion", &proportion, arg("n") = none, arg("effect") = none, arg("power") = none,
        py::kw_only(), arg("null") = 0.5, arg("alpha") = 0.05, arg("alternative") = "two-sided",
        arg("two_sample") = false, arg("extents") = false,
        (std::string("Power of the test of one proportion against `null` (of two "
                     "proportions, n in each, with two_sample=True); effects are "
                     "differences from the null, solved ones are proportions (qelcalc "
                     "power prop).") +
         kRule)
            .c_str());
  m.def("variance", &variance, arg("n") = none, arg("effect") = none, arg("power") = none,
        py::kw_only(), arg("method") = "levene", arg("kurtosis") = 0.0, arg("ratio_sd") = false,
        arg("alpha") = 0.05, arg("alternative") = "two-sided", arg("two_sample") = false,
        arg("extents") = false,
        (std::string("Power of a test of a variance against 1 (of two variances with "
                     "two_sample=True) by method 'chisq' (chi-square or F), 'bonett' "
                     "or 'levene'; the effect is the ratio of variances (of standard "
                     "deviations with ratio_sd=True) (qelcalc power variance).") +
         kRule)
            .c_str());
  m.def("poisson", &poisson, arg("n") = none, arg("effect") = none, arg("power") = none,
        py::kw_only(), arg("rate") = 1.0, arg("length") = none, arg("alpha") = 0.05,
        arg("alternative") = "two-sided", arg("two_sample") = false, arg("extents") = false,
        (std::string("Power of the test of a Poisson rate against `rate` (of two rates "
                     "with two_sample=True), over observation lengths `length` (one, "
                     "or one per sample; 1 by default); effects are differences from "
                     "the rate, solved ones are rates (qelcalc power poisson).") +
         kRule)
            .c_str());
}

}  // namespace power
}  // namespace qelpy
