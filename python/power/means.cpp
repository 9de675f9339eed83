// qel.power for means: t and z tests (one sample, paired, two samples),
// Welch's test and equivalence by two one-sided tests. Each function solves
// the one of n, effect and power that is not given, for every pair of the
// two given lists, as `qelcalc power t|z|paired|welch|tost` does.
#include <string>

#include "arguments.h"
#include "basic_statistics/PowerTOST.h"
#include "basic_statistics/PowerUtilities.h"
#include "utilities/LYNBasicTypes.h"

namespace qelpy {
namespace power {

namespace {

enum class MeanTest { kT, kZ, kPaired };

py::object tOrZ(MeanTest test, py::object n, py::object effect, py::object power, double sigma,
                double alpha, const std::string& alternative, bool twoSample, bool extents) {
  const Lists lists = readLists(n, effect, power, alpha, alternative);
  positive(sigma, "sigma");
  const Solved s = released([&] {
    qel::CmCmndPowerTAndZ c;
    setUp(c, lists, twoSample);
    c.mSetZTest(test == MeanTest::kZ);
    c.mSetPair(test == MeanTest::kPaired);
    c.mSetSigma(sigma);
    return finish(c, lists, extents);
  });
  return resultsOf(s, lists.given);
}

// Welch's test has no command: the same rule of what is solved, with n in
// each sample.
Solved solveWelch(const Lists& l, double s1, double s2) {
  Solved s;
  const auto a = l.alternative;
  if (!l.given.effect) {
    for (int n : l.n)
      for (double p : l.power)
        s.rows.push_back(
            {n, shown(qel::mCalcEffectForWelchTTestPower(a, p, n, n, s1, s2, l.alpha)), p, kNaN});
  } else if (!l.given.power) {
    for (double e : l.effect)
      for (int n : l.n)
        s.rows.push_back(
            {n, e, shown(qel::mCalcWelchTTestPower(a, n, n, e, s1, s2, l.alpha)), kNaN});
  } else {
    for (double e : l.effect)
      for (double p : l.power) {
        const int n = qel::mCalcSampleSizeForWelchTTestPower(a, p, e, s1, s2, l.alpha);
        const double q = n > 0 ? qel::mCalcWelchTTestPower(a, n, n, e, s1, s2, l.alpha) : kNaN;
        s.rows.push_back({n, e, shown(q), p});
      }
  }
  return s;
}

py::object welch(py::object n, py::object effect, py::object power, double sd1, double sd2,
                 double alpha, const std::string& alternative) {
  const Lists lists = readLists(n, effect, power, alpha, alternative);
  positive(sd1, "sd1");
  positive(sd2, "sd2");
  const Solved s = released([&] { return solveWelch(lists, sd1, sd2); });
  return resultsOf(s, lists.given);
}

// Limits that are unordered or (as ratios) not positive give rows of NaN,
// as the command does.
py::object equivalence(py::object n, py::object effect, py::object power, double lower,
                       double upper, bool ratio, bool paired, bool oneSample, double sigma,
                       double alpha, const std::string& alternative, bool extents) {
  const Lists lists = readLists(n, effect, power, alpha, alternative);
  finite(lower, "lower");
  finite(upper, "upper");
  positive(sigma, "sigma");
  if (paired && oneSample) throw py::value_error("give one of paired and one_sample");
  const Solved s = released([&] {
    qel::CmCmndPowerTOST c;
    setUp(c, lists, false);
    c.mSetSigma(sigma);
    c.mSetRatio(ratio);
    c.mSetLimits(lower, upper);
    c.mSetTestType(paired      ? qel::kTOSTPaired
                   : oneSample ? qel::kTOSTOneSample
                               : qel::kTOSTTwoSample);
    return finish(c, lists, extents);
  });
  return resultsOf(s, lists.given);
}

const char* const kRule =
    "\n\nGive two of n, effect and power (a number or a list each); the third is "
    "solved for every pair, in qelcalc's row order. Returns qel.power.Results, a "
    "list of PowerResult(n, effect, power, target): n is None where no size was "
    "found, effect and power NaN where none could be computed, target the power "
    "asked for when n is solved (NaN otherwise). extents=True also gives the "
    "x range of a power curve in Results.extents.";

}  // namespace

void registerMeans(py::module_& m) {
  using py::arg;
  const auto none = py::none();
  m.def(
      "t_test",
      [](py::object n, py::object effect, py::object power, double sigma, double alpha,
         const std::string& alternative, bool twoSample, bool extents) {
        return tOrZ(MeanTest::kT, n, effect, power, sigma, alpha, alternative, twoSample, extents);
      },
      arg("n") = none, arg("effect") = none, arg("power") = none, py::kw_only(), arg("sigma") = 1.0,
      arg("alpha") = 0.05, arg("alternative") = "two-sided", arg("two_sample") = false,
      arg("extents") = false,
      (std::string("Power of the t test of a mean (of two means, n in each, with "
                   "two_sample=True); the effect is the difference of means "
                   "(qelcalc power t).") +
       kRule)
          .c_str());
  m.def(
      "z_test",
      [](py::object n, py::object effect, py::object power, double sigma, double alpha,
         const std::string& alternative, bool twoSample, bool extents) {
        return tOrZ(MeanTest::kZ, n, effect, power, sigma, alpha, alternative, twoSample, extents);
      },
      arg("n") = none, arg("effect") = none, arg("power") = none, py::kw_only(), arg("sigma") = 1.0,
      arg("alpha") = 0.05, arg("alternative") = "two-sided", arg("two_sample") = false,
      arg("extents") = false,
      (std::string("Power of the z test of a mean with known sigma (qelcalc power z).") + kRule)
          .c_str());
  m.def(
      "paired_t",
      [](py::object n, py::object effect, py::object power, double sigma, double alpha,
         const std::string& alternative, bool extents) {
        return tOrZ(MeanTest::kPaired, n, effect, power, sigma, alpha, alternative, false, extents);
      },
      arg("n") = none, arg("effect") = none, arg("power") = none, py::kw_only(), arg("sigma") = 1.0,
      arg("alpha") = 0.05, arg("alternative") = "two-sided", arg("extents") = false,
      (std::string("Power of the paired t test; sigma is that of the differences "
                   "(qelcalc power paired).") +
       kRule)
          .c_str());
  m.def("welch", &welch, arg("n") = none, arg("effect") = none, arg("power") = none, py::kw_only(),
        arg("sd1") = 1.0, arg("sd2") = 1.0, arg("alpha") = 0.05, arg("alternative") = "two-sided",
        (std::string("Power of Welch's two-sample t test with n in each sample and "
                     "standard deviations sd1, sd2 (qelcalc power welch).") +
         kRule)
            .c_str());
  m.def("equivalence", &equivalence, arg("n") = none, arg("effect") = none, arg("power") = none,
        py::kw_only(), arg("lower"), arg("upper"), arg("ratio") = false, arg("paired") = false,
        arg("one_sample") = false, arg("sigma") = 1.0, arg("alpha") = 0.05,
        arg("alternative") = "two-sided", arg("extents") = false,
        (std::string("Power of the equivalence test by two one-sided tests on the "
                     "interval (lower, upper) of differences of means (of ratios with "
                     "ratio=True, worked in logs); two samples unless paired or "
                     "one_sample. A solved difference comes with its mirror in the "
                     "centre; a target above the peak power gives one NaN row; n "
                     "999999: no size up to 999999 reaches the target (qelcalc power "
                     "tost).") +
         kRule)
            .c_str());
}

}  // namespace power
}  // namespace qelpy
