// Proportions (one and two) and variances (one, two and k samples).
#include <qel/proportion_tests.h>
#include <qel/variance_tests.h>
#include <qel/variances_test.h>

#include <algorithm>

#include "common.h"

namespace qelpy {

namespace {

py::object f(double v) {
  return py::float_(v);
}

struct Sides {
  Sides(const std::string& alternativeName, py::handle interval, double confidenceLevel)
      : alternative(alternativeOf(alternativeName)),
        type(intervalOf(interval, alternative)),
        confidence(confidenceOf(confidenceLevel)) {}
  qel::AlternativeHypothesis alternative;
  qel::IntervalType type;
  double confidence;
};

// Events and trials of one sample: whole, not negative, events <= trials.
void checkCounts(long long events, long long trials) {
  const long long top = std::numeric_limits<unsigned>::max();
  if (events < 0 || trials < 0 || events > top || trials > top) {
    throw py::value_error("events and trials must be whole numbers in [0, 2^32)");
  }
  if (events > trials) throw py::value_error("events exceed trials");
}

// The one-proportion methods: interval and test of each.
int runOneProportion(qel::v0::OneProportion* r, const std::string& method, const Sides& s,
                     double p0) {
  using namespace qel::v0;
  if (method == "lyn-normal" || method == "lyn-exact") {
    return RunLynOneProportion(r, method == "lyn-normal", s.confidence, s.type, s.alternative, p0);
  }
  int code = 0;
  if (method == "exact") {
    code = RunOneProportionClopperPearson(r, s.confidence, s.type);
    if (code == 0) code = RunOneProportionClopperPearson(r, s.alternative, p0);
  } else if (method == "mid-p") {
    code = RunOneProportionMidP(r, s.confidence, s.type);
    if (code == 0) code = RunOneProportionMidP(r, s.alternative, p0);
  } else if (method == "wilson" || method == "wilson-cc" || method == "wald" ||
             method == "wald-cc") {
    const bool corrected = method == "wilson-cc" || method == "wald-cc";
    code = method.compare(0, 6, "wilson") == 0
               ? RunOneProportionWilson(r, corrected, s.confidence, s.type)
               : RunOneProportionWaldCI(r, corrected, s.confidence, s.type);
    if (code == 0) code = RunOneProportionWilson(r, corrected, s.alternative, p0);
  } else if (method == "agresti-coull") {
    code = RunOneProportionAgrestiCoullCI(r, false, s.confidence, s.type);
  }
  return code;
}

void registerProportions(py::module_& m) {
  m.def(
      "one_proportion",
      [](long long events, long long trials, double p0, const std::string& method,
         double confidence, const std::string& alternative, py::handle interval) {
        checkCounts(events, trials);
        static const char* methods[] = {"exact", "wilson",     "wilson-cc",
                                        "wald",  "wald-cc",    "agresti-coull",
                                        "mid-p", "lyn-normal", "lyn-exact"};
        if (std::find(std::begin(methods), std::end(methods), method) == std::end(methods)) {
          throw py::value_error(
              "method must be one of exact, wilson, wilson-cc, wald, wald-cc, "
              "agresti-coull, mid-p, lyn-normal, lyn-exact");
        }
        if (!(p0 > 0.0 && p0 < 1.0)) throw py::value_error("p0 must lie in (0, 1)");
        Sides s(alternative, interval, confidence);
        qel::v0::OneProportion r;
        r.events = static_cast<unsigned>(events);
        r.trials = static_cast<unsigned>(trials);
        if (method.compare(0, 4, "lyn-") != 0)
          r.proportion = qel::v0::GetSampleProportion(r.events, r.trials);
        const int code = released([&] { return runOneProportion(&r, method, s, p0); });
        check(code);
        return result("OneProportion", {{"events", py::int_(r.events)},
                                        {"trials", py::int_(r.trials)},
                                        {"proportion", f(r.proportion)},
                                        {"lower_limit", f(r.lowerLimit)},
                                        {"upper_limit", f(r.upperLimit)},
                                        {"statistic", f(r.statistic)},
                                        {"p_value", f(r.pValue)},
                                        {"method", py::str(method)},
                                        {"status", py::int_(code)}});
      },
      py::arg("events"), py::arg("trials"), py::arg("p0") = 0.5, py::arg("method") = "exact",
      py::arg("confidence") = 0.95, py::arg("alternative") = "two-sided",
      py::arg("interval") = py::none(),
      "One binomial proportion: interval and test of p0 by the method (exact = "
      "Clopper-Pearson, wilson[-cc], wald[-cc], agresti-coull, mid-p, lyn-normal, lyn-exact).");
  m.def(
      "two_proportions",
      [](long long events1, long long trials1, long long events2, long long trials2, bool pooled,
         double delta, double confidence, const std::string& alternative, py::handle interval) {
        checkCounts(events1, trials1);
        checkCounts(events2, trials2);
        Sides s(alternative, interval, confidence);
        qel::v0::TwoProportion r;
        r.firstEvents = static_cast<unsigned>(events1);
        r.firstTrials = static_cast<unsigned>(trials1);
        r.secondEvents = static_cast<unsigned>(events2);
        r.secondTrials = static_cast<unsigned>(trials2);
        const int code = released([&] {
          return qel::v0::RunLynTwoProportion(&r, pooled, s.confidence, s.type, s.alternative,
                                              delta);
        });
        check(code);
        return result("TwoProportions", {{"first_events", py::int_(r.firstEvents)},
                                         {"first_trials", py::int_(r.firstTrials)},
                                         {"second_events", py::int_(r.secondEvents)},
                                         {"second_trials", py::int_(r.secondTrials)},
                                         {"first_proportion", f(r.firstProportion)},
                                         {"second_proportion", f(r.secondProportion)},
                                         {"difference", f(r.difference)},
                                         {"lower_limit", f(r.lowerLimit)},
                                         {"upper_limit", f(r.upperLimit)},
                                         {"statistic", f(r.statistic)},
                                         {"p_value", f(r.pValue)},
                                         {"exact_p_value", f(r.exactPValue)},
                                         {"status", py::int_(code)}});
      },
      py::arg("events1"), py::arg("trials1"), py::arg("events2"), py::arg("trials2"),
      py::arg("pooled") = false, py::arg("delta") = 0.0, py::arg("confidence") = 0.95,
      py::arg("alternative") = "two-sided", py::arg("interval") = py::none(),
      "Difference of two proportions: Wald interval, z test (pooled when asked and delta is 0) "
      "and Fisher's exact P-value (delta 0).");
}

py::object twoVariance(const qel::v0::TwoVariance& r, int code) {
  return result("TwoVariances", {{"first_n", py::int_(r.firstN)},
                                 {"second_n", py::int_(r.secondN)},
                                 {"first_variance", f(r.firstVariance)},
                                 {"second_variance", f(r.secondVariance)},
                                 {"first_sd_lower_limit", f(r.firstStdDevLowerLimit)},
                                 {"first_sd_upper_limit", f(r.firstStdDevUpperLimit)},
                                 {"second_sd_lower_limit", f(r.secondStdDevLowerLimit)},
                                 {"second_sd_upper_limit", f(r.secondStdDevUpperLimit)},
                                 {"bonett_lower_limit", f(r.bonettLowerLimit)},
                                 {"bonett_upper_limit", f(r.bonettUpperLimit)},
                                 {"levene_lower_limit", f(r.leveneLowerLimit)},
                                 {"levene_upper_limit", f(r.leveneUpperLimit)},
                                 {"f_lower_limit", f(r.fLowerLimit)},
                                 {"f_upper_limit", f(r.fUpperLimit)},
                                 {"bonett_statistic", f(r.bonettStatistic)},
                                 {"bonett_p_value", f(r.bonettPValue)},
                                 {"levene_statistic", f(r.leveneStatistic)},
                                 {"levene_p_value", f(r.levenePValue)},
                                 {"levene_degrees_of_freedom", f(r.leveneDegreesOfFreedom)},
                                 {"f_statistic", f(r.fStatistic)},
                                 {"f_p_value", f(r.fPValue)},
                                 {"f_df1", f(r.fNumeratorDegreesOfFreedom)},
                                 {"f_df2", f(r.fDenominatorDegreesOfFreedom)},
                                 {"status", py::int_(code)}});
}

void registerVariances(py::module_& m) {
  m.def(
      "one_variance",
      [](py::handle x, double variance0, double confidence, const std::string& alternative,
         py::handle interval) {
        Doubles a = column(x, "x");
        if (!(variance0 > 0.0)) throw py::value_error("variance0 must be positive");
        Sides s(alternative, interval, confidence);
        qel::v0::OneVariance r;
        r.n = count(a);
        const int code = released([&] {
          return qel::v0::RunOneVariance(&r, a.data(), s.confidence, s.type, s.alternative,
                                         variance0);
        });
        check(code);
        return result("OneVariance", {{"n", py::int_(r.n)},
                                      {"variance", f(r.variance)},
                                      {"chi_square_lower_limit", f(r.chiSquareLowerLimit)},
                                      {"chi_square_upper_limit", f(r.chiSquareUpperLimit)},
                                      {"bonett_lower_limit", f(r.bonettLowerLimit)},
                                      {"bonett_upper_limit", f(r.bonettUpperLimit)},
                                      {"chi_square_statistic", f(r.chiSquareStatistic)},
                                      {"chi_square_p_value", f(r.chiSquarePValue)},
                                      {"degrees_of_freedom", f(r.degreesOfFreedom)},
                                      {"bonett_p_value", f(r.bonettPValue)},
                                      {"status", py::int_(code)}});
      },
      py::arg("x"), py::arg("variance0") = 1.0, py::arg("confidence") = 0.95,
      py::arg("alternative") = "two-sided", py::arg("interval") = py::none(),
      "One variance: chi-square and Bonett (2006) intervals and tests of variance0.");
  m.def(
      "two_variances",
      [](py::handle x, py::handle y, double ratio, bool levene, double confidence,
         const std::string& alternative, py::handle interval) {
        Doubles a = column(x, "x"), b = column(y, "y");
        if (!(ratio > 0.0 && std::isfinite(ratio))) throw py::value_error("ratio must be positive");
        Sides s(alternative, interval, confidence);
        qel::v0::TwoVariance r;
        r.firstN = count(a);
        r.secondN = count(b);
        const int code = released([&] {
          return qel::v0::RunTwoVariance(&r, a.data(), b.data(), s.confidence, s.type,
                                         s.alternative, ratio, levene);
        });
        check(code);
        return twoVariance(r, code);
      },
      py::arg("x"), py::arg("y"), py::arg("ratio") = 1.0, py::arg("levene") = false,
      py::arg("confidence") = 0.95, py::arg("alternative") = "two-sided",
      py::arg("interval") = py::none(),
      "Ratio of two standard deviations sigma1/sigma2 = ratio: F, and Bonett's method or "
      "(levene) a Levene-type test; chi-square limits of each deviation.");
  m.def(
      "two_variances_summary",
      [](double variance1, unsigned n1, double variance2, unsigned n2, double ratio,
         double confidence, const std::string& alternative, py::handle interval) {
        if (!(ratio > 0.0 && std::isfinite(ratio))) throw py::value_error("ratio must be positive");
        Sides s(alternative, interval, confidence);
        qel::v0::TwoVariance r;
        r.firstVariance = variance1;
        r.secondVariance = variance2;
        r.firstN = n1;
        r.secondN = n2;
        const int code = released([&] {
          return qel::v0::RunTwoVariance(&r, s.confidence, s.type, s.alternative, ratio);
        });
        check(code);
        return twoVariance(r, code);
      },
      py::arg("variance1"), py::arg("n1"), py::arg("variance2"), py::arg("n2"),
      py::arg("ratio") = 1.0, py::arg("confidence") = 0.95, py::arg("alternative") = "two-sided",
      py::arg("interval") = py::none(),
      "F interval and test of sigma1/sigma2 = ratio and chi-square limits of each deviation, "
      "from the variances and sizes.");
  m.def(
      "variances_test",
      [](py::handle groups, double confidence, bool assumeNormal) {
        std::vector<Doubles> data = columns(groups, "groups", 1);
        const double level = confidenceOf(confidence);
        std::vector<qel::v0::VariancesTestSample> samples(data.size());
        for (std::size_t i = 0; i < data.size(); ++i) {
          samples[i].data = data[i].data();
          samples[i].n = count(data[i]);
        }
        qel::v0::VariancesTest t;
        t.samples = samples.data();
        t.k = static_cast<unsigned>(samples.size());
        const int code = released([&] {
          return assumeNormal ? qel::v0::RunVariancesTest(&t, level, true)
                              : qel::v0::RunVariancesTest(&t, level);
        });
        check(code);
        py::list out;
        for (const auto& s : samples) {
          out.append(
              result("VariancesTestSample", {{"n", py::int_(s.n)},
                                             {"variance", f(s.variance)},
                                             {"lower_limit", f(s.lowerLimit)},
                                             {"upper_limit", f(s.upperLimit)},
                                             {"comparison_lower_limit", f(s.thirdWorkValue)},
                                             {"comparison_upper_limit", f(s.fourthWorkValue)}}));
        }
        return result("VariancesTest", {{"main_statistic", f(t.mainStatistic)},
                                        {"main_p_value", f(t.mainPValue)},
                                        {"levene_statistic", f(t.leveneStatistic)},
                                        {"levene_p_value", f(t.levenePValue)},
                                        {"individual_confidence", f(t.individualConfidence)},
                                        {"samples", out},
                                        {"status", py::int_(code)}});
      },
      py::arg("groups"), py::arg("confidence") = 0.95, py::arg("assume_normal") = false,
      "Equality of k variances: Bartlett (F for two) when assume_normal, otherwise Bonett's "
      "multiple comparisons with Levene's test.");
}

}  // namespace

void registerProportionVarianceTests(py::module_& m) {
  registerProportions(m);
  registerVariances(m);
}

}  // namespace qelpy
