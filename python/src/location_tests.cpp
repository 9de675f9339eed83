// Location tests: one-sample t and z, paired t, two-sample t, the sign and
// Wilcoxon signed rank tests and the runs test.
#include <qel/descriptive.h>
#include <qel/interval.h>
#include <qel/location_tests.h>
#include <qel/sign_tests.h>

#include "common.h"

namespace qelpy {

namespace {

py::object f(double v) {
  return py::float_(v);
}

// Alternative and interval of a test call.
struct Sides {
  Sides(const std::string& alternativeName, py::handle interval, double confidenceLevel)
      : alternative(alternativeOf(alternativeName)),
        type(intervalOf(interval, alternative)),
        confidence(confidenceOf(confidenceLevel)) {}
  qel::AlternativeHypothesis alternative;
  qel::IntervalType type;
  double confidence;
};

py::object oneSampleT(const qel::v0::OneSampleT& r, int code) {
  return result("OneSampleT", {{"n", py::int_(r.n)},
                               {"mean", f(r.mean)},
                               {"standard_deviation", f(r.standardDeviation)},
                               {"standard_error", f(r.standardError)},
                               {"lower_limit", f(r.lowerLimit)},
                               {"upper_limit", f(r.upperLimit)},
                               {"statistic", f(r.statistic)},
                               {"p_value", f(r.pValue)},
                               {"status", py::int_(code)}});
}

py::object oneSampleZ(const qel::v0::OneSampleZ& r, int code) {
  return result("OneSampleZ", {{"n", py::int_(r.n)},
                               {"mean", f(r.mean)},
                               {"standard_deviation", f(r.standardDeviation)},
                               {"standard_error", f(r.standardError)},
                               {"lower_limit", f(r.lowerLimit)},
                               {"upper_limit", f(r.upperLimit)},
                               {"statistic", f(r.statistic)},
                               {"p_value", f(r.pValue)},
                               {"status", py::int_(code)}});
}

py::object twoSampleT(const qel::v0::TwoSampleT& r, int code) {
  return result("TwoSampleT", {{"first_n", py::int_(r.firstN)},
                               {"second_n", py::int_(r.secondN)},
                               {"first_mean", f(r.firstMean)},
                               {"second_mean", f(r.secondMean)},
                               {"first_standard_deviation", f(r.firstStandardDeviation)},
                               {"second_standard_deviation", f(r.secondStandardDeviation)},
                               {"first_standard_error", f(r.firstStandardError)},
                               {"second_standard_error", f(r.secondStandardError)},
                               {"difference", f(r.difference)},
                               {"pooled_standard_deviation", f(r.pooledStandardDeviation)},
                               {"degrees_of_freedom", f(r.degreesOfFreedom)},
                               {"lower_limit", f(r.lowerLimit)},
                               {"upper_limit", f(r.upperLimit)},
                               {"statistic", f(r.statistic)},
                               {"p_value", f(r.pValue)},
                               {"status", py::int_(code)}});
}

void registerTTests(py::module_& m) {
  m.def(
      "one_sample_t",
      [](py::handle x, double mu, double confidence, const std::string& alternative,
         py::handle interval) {
        Doubles a = column(x, "x");
        Sides s(alternative, interval, confidence);
        qel::v0::OneSampleT r;
        r.n = count(a);
        const int code = released([&] {
          return qel::v0::RunOneSampleT(&r, a.data(), s.confidence, s.type, s.alternative, mu);
        });
        check(code);
        return oneSampleT(r, code);
      },
      py::arg("x"), py::arg("mu") = 0.0, py::arg("confidence") = 0.95,
      py::arg("alternative") = "two-sided", py::arg("interval") = py::none(),
      "One-sample t test of mean mu with its interval (interval: 'two-sided', 'lower', "
      "'upper'; by default it follows the alternative).");
  m.def(
      "one_sample_t_summary",
      [](double mean, double sd, unsigned n, double mu, double confidence,
         const std::string& alternative, py::handle interval) {
        Sides s(alternative, interval, confidence);
        qel::v0::OneSampleT r;
        r.n = n;
        r.mean = mean;
        r.standardDeviation = sd;
        const int code = released(
            [&] { return qel::v0::RunOneSampleT(&r, s.confidence, s.type, s.alternative, mu); });
        check(code);
        return oneSampleT(r, code);
      },
      py::arg("mean"), py::arg("sd"), py::arg("n"), py::arg("mu") = 0.0,
      py::arg("confidence") = 0.95, py::arg("alternative") = "two-sided",
      py::arg("interval") = py::none(), "One-sample t test from mean, deviation and n.");
  m.def(
      "one_sample_z_summary",
      [](double mean, unsigned n, double sigma, double mu, double confidence,
         const std::string& alternative, py::handle interval) {
        Sides s(alternative, interval, confidence);
        qel::v0::OneSampleZ r;
        r.n = n;
        r.mean = mean;
        const int code = released([&] {
          return qel::v0::RunOneSampleZ(&r, sigma, s.confidence, s.type, s.alternative, mu);
        });
        check(code);
        return oneSampleZ(r, code);
      },
      py::arg("mean"), py::arg("n"), py::arg("sigma") = 1.0, py::arg("mu") = 0.0,
      py::arg("confidence") = 0.95, py::arg("alternative") = "two-sided",
      py::arg("interval") = py::none(), "One-sample z test from the mean and n.");
  m.def(
      "symmetric_interval",
      [](double estimate, double standardError, double confidence, py::object df,
         py::handle interval) {
        const qel::IntervalType type = intervalOf(interval, qel::kAlternativeNotEqual);
        double lower = kNaN, upper = kNaN;
        int code = 0;
        if (df.is_none()) {
          code = released([&] {
            return qel::v1::MakeTraditionalSymmetricCI(qel::v0::NormalInvCdfFunc(), confidence,
                                                       type, estimate, standardError, &lower,
                                                       &upper);
          });
        } else {
          const qel::v0::TInvCdfFunc quantile(df.cast<double>());
          code = released([&] {
            return qel::v1::MakeTraditionalSymmetricCI(quantile, confidence, type, estimate,
                                                       standardError, &lower, &upper);
          });
        }
        check(code);
        return py::make_tuple(lower, upper);
      },
      py::arg("estimate"), py::arg("standard_error"), py::arg("confidence") = 0.95,
      py::arg("df") = py::none(), py::arg("interval") = "two-sided",
      "(lower, upper) = estimate -/+ standard_error times the normal quantile (the t quantile "
      "on df degrees of freedom when given); one-sided intervals leave one limit infinite.");
  m.def(
      "one_sample_z",
      [](py::handle x, double sigma, double mu, double confidence, const std::string& alternative,
         py::handle interval) {
        Doubles a = column(x, "x");
        Sides s(alternative, interval, confidence);
        qel::v0::OneSampleZ r;
        r.n = count(a);
        const int code = released([&] {
          return qel::v0::RunOneSampleZ(&r, a.data(), sigma, s.confidence, s.type, s.alternative,
                                        mu);
        });
        check(code);
        return oneSampleZ(r, code);
      },
      py::arg("x"), py::arg("sigma") = 1.0, py::arg("mu") = 0.0, py::arg("confidence") = 0.95,
      py::arg("alternative") = "two-sided", py::arg("interval") = py::none(),
      "One-sample z test with known sigma.");
  m.def(
      "paired_t",
      [](py::handle x, py::handle y, double mu, double confidence, const std::string& alternative,
         py::handle interval) {
        Doubles a = column(x, "x"), b = column(y, "y");
        if (a.size() != b.size()) throw py::value_error("x and y must have the same length");
        Sides s(alternative, interval, confidence);
        qel::v0::PairedT r;
        r.n = count(a);
        const int code = released([&] {
          return qel::v0::RunPairedT(&r, a.data(), b.data(), s.confidence, s.type, s.alternative,
                                     mu);
        });
        check(code);
        return result("PairedT",
                      {{"n", py::int_(r.n)},
                       {"first_mean", f(r.firstMean)},
                       {"second_mean", f(r.secondMean)},
                       {"first_standard_deviation", f(r.firstStandardDeviation)},
                       {"second_standard_deviation", f(r.secondStandardDeviation)},
                       {"first_standard_error", f(r.firstStandardError)},
                       {"second_standard_error", f(r.secondStandardError)},
                       {"mean_difference", f(r.meanDifference)},
                       {"standard_deviation_of_differences", f(r.standardDeviationOfDifferences)},
                       {"standard_error_of_differences", f(r.standardErrorOfDifferences)},
                       {"lower_limit", f(r.lowerLimit)},
                       {"upper_limit", f(r.upperLimit)},
                       {"statistic", f(r.statistic)},
                       {"p_value", f(r.pValue)},
                       {"status", py::int_(code)}});
      },
      py::arg("x"), py::arg("y"), py::arg("mu") = 0.0, py::arg("confidence") = 0.95,
      py::arg("alternative") = "two-sided", py::arg("interval") = py::none(),
      "Paired t test on the differences x - y.");
  m.def(
      "two_sample_t",
      [](py::handle x, py::handle y, bool pooled, double delta, double confidence,
         const std::string& alternative, py::handle interval) {
        Doubles a = column(x, "x"), b = column(y, "y");
        Sides s(alternative, interval, confidence);
        qel::v0::TwoSampleT r;
        r.firstN = count(a);
        r.secondN = count(b);
        const int code = released([&] {
          return qel::v0::RunTwoSampleT(&r, a.data(), b.data(), pooled, s.confidence, s.type,
                                        s.alternative, delta);
        });
        check(code);
        return twoSampleT(r, code);
      },
      py::arg("x"), py::arg("y"), py::arg("pooled") = false, py::arg("delta") = 0.0,
      py::arg("confidence") = 0.95, py::arg("alternative") = "two-sided",
      py::arg("interval") = py::none(),
      "Two-sample t test of mean(x) - mean(y) = delta: Welch's (whole degrees of freedom) "
      "unless pooled.");
  m.def(
      "two_sample_t_summary",
      [](double mean1, double sd1, unsigned n1, double mean2, double sd2, unsigned n2, bool pooled,
         double delta, double confidence, const std::string& alternative, py::handle interval) {
        Sides s(alternative, interval, confidence);
        qel::v0::TwoSampleT r;
        r.firstN = n1;
        r.secondN = n2;
        r.firstMean = mean1;
        r.secondMean = mean2;
        r.firstStandardDeviation = sd1;
        r.secondStandardDeviation = sd2;
        const int code = released([&] {
          return qel::v0::RunTwoSampleT(&r, pooled, s.confidence, s.type, s.alternative, delta);
        });
        check(code);
        return twoSampleT(r, code);
      },
      py::arg("mean1"), py::arg("sd1"), py::arg("n1"), py::arg("mean2"), py::arg("sd2"),
      py::arg("n2"), py::arg("pooled") = false, py::arg("delta") = 0.0,
      py::arg("confidence") = 0.95, py::arg("alternative") = "two-sided",
      py::arg("interval") = py::none(), "Two-sample t test from summary values.");
}

void registerDistributionFree(py::module_& m) {
  m.def(
      "sign_test",
      [](py::handle x, double mu, double confidence, const std::string& alternative,
         py::handle interval, bool approximate) {
        Doubles a = column(x, "x");
        Sides s(alternative, interval, confidence);
        qel::v0::OneSampleSign r;
        r.n = count(a);
        qel::v0::InitializeOneSampleSign(&r);
        const int code = released([&] {
          return approximate ? qel::v0::RunLynOneSampleSign(&r, a.data(), s.confidence, s.type,
                                                            s.alternative, mu)
                             : qel::v0::RunOneSampleSign(&r, a.data(), s.confidence, s.type,
                                                         s.alternative, mu);
        });
        check(code);
        return result("SignTest", {{"n", py::int_(r.n)},
                                   {"median", f(r.median)},
                                   {"narrower_confidence", f(r.narrowerConfidence)},
                                   {"wider_confidence", f(r.widerConfidence)},
                                   {"narrower_lower_limit", f(r.narrowerLowerLimit)},
                                   {"interpolated_lower_limit", f(r.interpolatedLowerLimit)},
                                   {"wider_lower_limit", f(r.widerLowerLimit)},
                                   {"narrower_upper_limit", f(r.narrowerUpperLimit)},
                                   {"interpolated_upper_limit", f(r.interpolatedUpperLimit)},
                                   {"wider_upper_limit", f(r.widerUpperLimit)},
                                   {"narrower_position", f(r.narrowerPosition)},
                                   {"wider_position", f(r.widerPosition)},
                                   {"p_value", f(r.pValue)},
                                   {"count_below", f(r.countBelow)},
                                   {"count_equal", f(r.countEqual)},
                                   {"count_above", f(r.countAbove)},
                                   {"status", py::int_(code)}});
      },
      py::arg("x"), py::arg("mu") = 0.0, py::arg("confidence") = 0.95,
      py::arg("alternative") = "two-sided", py::arg("interval") = py::none(),
      py::arg("approximate") = false,
      "Sign test of median mu with the interpolated interval of the median (exact binomial; "
      "approximate: the normal approximation above n = 50).");
  m.def(
      "wilcoxon",
      [](py::handle x, double mu, double confidence, const std::string& alternative,
         py::handle interval) {
        Doubles a = column(x, "x");
        Sides s(alternative, interval, confidence);
        qel::v0::OneSampleWilcoxon r;
        r.n = static_cast<int>(count(a));
        const int code = released([&] {
          return qel::v0::RunLynOneSampleWilcoxon(&r, a.data(), s.confidence, s.type, s.alternative,
                                                  mu);
        });
        check(code);
        return result("Wilcoxon", {{"n", py::int_(r.n)},
                                   {"estimated_median", f(r.estimatedMedian)},
                                   {"achieved_confidence", f(r.achievedConfidence)},
                                   {"lower_limit", f(r.lowerLimit)},
                                   {"upper_limit", f(r.upperLimit)},
                                   {"statistic", f(r.W)},
                                   {"p_value", f(r.pValue)},
                                   {"status", py::int_(code)}});
      },
      py::arg("x"), py::arg("mu") = 0.0, py::arg("confidence") = 0.95,
      py::arg("alternative") = "two-sided", py::arg("interval") = py::none(),
      "Wilcoxon signed rank test with the Hodges-Lehmann estimate and interval.");
  m.def(
      "runs_test",
      [](py::handle x, py::object k, bool approximate) {
        Doubles a = column(x, "x");
        const double about =
            k.is_none() ? qel::v1::GetSampleMean(a.data(), count(a)) : k.cast<double>();
        qel::v1::RunsTest r;
        const int code = released([&] {
          return approximate ? qel::v1::RunLynRunsTest(&r, a.data(), about, count(a))
                             : qel::v1::RunRunsTest(&r, a.data(), about, count(a));
        });
        check(code);
        return result("RunsTest", {{"k", f(about)},
                                   {"count_below", py::int_(r.countBelow)},
                                   {"count_above", py::int_(r.countAbove)},
                                   {"observed_runs", py::int_(r.observedRuns)},
                                   {"expected_runs", f(r.expectedRuns)},
                                   {"p_value", f(r.pValue)}});
      },
      py::arg("x"), py::arg("k") = py::none(), py::arg("approximate") = false,
      "Runs test above and below k (default the mean): exact P-value, or the normal "
      "approximation.");
}

}  // namespace

void registerLocationTests(py::module_& m) {
  registerTTests(m);
  registerDistributionFree(m);
}

}  // namespace qelpy
