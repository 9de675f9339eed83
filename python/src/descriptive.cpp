// Descriptive statistics, order statistics and the summaries of a column.
#include <qel/descriptive.h>
#include <qel/order_statistics.h>
#include <qel/summaries.h>

#include <algorithm>

#include "common.h"

namespace qelpy {

namespace {

py::object f(double v) {
  return py::float_(v);
}
py::object u(unsigned v) {
  return py::int_(v);
}

// Two columns of one length.
std::pair<Doubles, Doubles> pairOf(py::handle x, py::handle y) {
  Doubles a = column(x, "x"), b = column(y, "y");
  if (a.size() != b.size()) throw py::value_error("x and y must have the same length");
  return {a, b};
}

// A sorted copy of a column (the library's ...OnSorted functions).
std::vector<double> sortedCopy(const Doubles& a) {
  std::vector<double> s(a.data(), a.data() + a.size());
  py::gil_scoped_release release;
  std::sort(s.begin(), s.end());
  return s;
}

py::object fiveNumbers(const qel::v1::FiveNumberSummary& s) {
  return result("FiveNumberSummary", {{"minimum", f(s.minimum)},
                                      {"first_quartile", f(s.firstQuartile)},
                                      {"median", f(s.median)},
                                      {"third_quartile", f(s.thirdQuartile)},
                                      {"maximum", f(s.maximum)}});
}

void registerMoments(py::module_& m) {
  m.def(
      "mean",
      [](py::handle x) {
        Doubles a = column(x, "x");
        return released([&] { return qel::v1::GetSampleMean(a.data(), count(a)); });
      },
      py::arg("x"), "Compensated one-pass mean; NaN for no data.");
  m.def(
      "variance",
      [](py::handle x, py::object center) {
        Doubles a = column(x, "x");
        if (center.is_none()) {
          return released([&] { return qel::v1::GetSampleVariance(a.data(), count(a)); });
        }
        const double c = center.cast<double>();
        return released([&] { return qel::v1::GetSampleVariance(a.data(), count(a), c); });
      },
      py::arg("x"), py::arg("center") = py::none(),
      "Sample variance (denominator n - 1), optionally from deviations about a centre.");
  m.def(
      "covariance",
      [](py::handle x, py::handle y) {
        auto xy = pairOf(x, y);
        double vx = kNaN, vy = kNaN;
        const double c = released([&] {
          return qel::v1::GetCovariance(xy.first.data(), xy.second.data(), count(xy.first), &vx,
                                        &vy);
        });
        return result("Covariance",
                      {{"covariance", f(c)}, {"variance_x", f(vx)}, {"variance_y", f(vy)}});
      },
      py::arg("x"), py::arg("y"));
  m.def(
      "pearson",
      [](py::handle x, py::handle y) {
        auto xy = pairOf(x, y);
        return released([&] {
          return qel::v1::GetPearsonCorrelation(xy.first.data(), xy.second.data(), count(xy.first));
        });
      },
      py::arg("x"), py::arg("y"), "Pearson's r.");
  m.def(
      "spearman",
      [](py::handle x, py::handle y) {
        auto xy = pairOf(x, y);
        int status = 0;
        const double r = released([&] {
          return qel::v1::GetSpearmanCorrelation(xy.first.data(), xy.second.data(), count(xy.first),
                                                 &status);
        });
        check(status);
        return r;
      },
      py::arg("x"), py::arg("y"), "Spearman's rho.");
  m.def("correlation_pvalue", &qel::v0::GetLynCorrelationPValue, py::arg("r"), py::arg("n"),
        "Two-sided P-value of the t test of a correlation r from n pairs.");
  m.def(
      "central_sums",
      [](py::handle x, unsigned k) {
        Doubles a = column(x, "x");
        std::vector<double> out(k);
        const int code = released(
            [&] { return qel::v1::GetCenteredOrderKPowerSums(a.data(), count(a), out.data(), k); });
        check(code);
        return toArray(out.data(), k);
      },
      py::arg("x"), py::arg("k") = 4u, "The mean and the central sums of powers 2, 3 and 4.");
  m.def(
      "compensated_sum",
      [](py::handle x) {
        Doubles a = column(x, "x");
        return released([&] { return qel::v1::GetSum(a.data(), count(a)); });
      },
      py::arg("x"));
  m.def(
      "cumulative_sums",
      [](py::handle x) {
        Doubles a = column(x, "x");
        py::array_t<double> out(a.size());
        double* o = out.mutable_data();
        released([&] { qel::v1::GetCumulativeSums(a.data(), count(a), o); });
        return out;
      },
      py::arg("x"));
  m.def(
      "proportions",
      [](py::handle x) {
        Doubles a = column(x, "x");
        py::array_t<double> out(a.size());
        double* o = out.mutable_data();
        released([&] { qel::v1::GetProportions(a.data(), count(a), o); });
        return out;
      },
      py::arg("x"), "Each value divided by the sum.");
  m.def(
      "skewness_kurtosis",
      [](py::handle x) {
        Doubles a = column(x, "x");
        double s = kNaN, k = kNaN;
        released([&] { qel::v1::GetLynSkewnessAndKurtosis(a.data(), count(a), &s, &k); });
        return result("Shape", {{"skewness", f(s)}, {"kurtosis", f(k)}});
      },
      py::arg("x"), "Sample skewness and excess kurtosis, adjusted for sample size.");
  m.def(
      "moments",
      [](py::handle x) {
        Doubles a = column(x, "x");
        qel::v1::SecondSampleMoments mo;
        mo.n = count(a);
        released([&] { qel::v1::GetSecondSampleMoments(&mo, a.data()); });
        return result("SecondSampleMoments", {{"n", u(mo.n)},
                                              {"mean", f(mo.mean)},
                                              {"variance", f(mo.variance)},
                                              {"sum", f(mo.sum)},
                                              {"sum_of_squares", f(mo.sumOfSquares)}});
      },
      py::arg("x"));
  m.def(
      "order",
      [](py::handle x) {
        Doubles a = column(x, "x");
        py::array_t<unsigned> out(a.size());
        unsigned* o = out.mutable_data();
        released([&] { qel::v1::GetOrder(a.data(), count(a), o); });
        return out;
      },
      py::arg("x"), "Indices of the values from the smallest up; NaN last.");
  m.def(
      "rank",
      [](py::handle x) {
        Doubles a = column(x, "x");
        py::array_t<double> out(a.size());
        double* o = out.mutable_data();
        check(released([&] { return qel::v1::GetRank(a.data(), count(a), o); }));
        return out;
      },
      py::arg("x"), "Ranks from 1, ties averaged.");
}

void registerOrderStatistics(py::module_& m) {
  m.def(
      "quantiles",
      [](py::handle x, py::handle probabilities, int type) {
        Doubles a = column(x, "x");
        const bool one = isScalar(probabilities);
        Doubles p = numbers(probabilities, "probabilities");
        if (p.ndim() > 1) throw py::value_error("probabilities must be one-dimensional");
        std::vector<double> q(static_cast<std::size_t>(p.size()));
        check(released([&] {
          return qel::v1::GetSampleQuantiles(a.data(), count(a), type, q.data(), p.data(),
                                             static_cast<unsigned>(q.size()));
        }));
        return one ? py::object(py::float_(q[0])) : py::object(toArray(q.data(), q.size()));
      },
      py::arg("x"), py::arg("probabilities"), py::arg("type") = 7,
      "Sample quantiles of type 1..9 (Hyndman and Fan 1996).");
  m.def(
      "median",
      [](py::handle x) {
        std::vector<double> s = sortedCopy(column(x, "x"));
        return qel::v1::GetTypicalMedian(s.data(), static_cast<unsigned>(s.size()));
      },
      py::arg("x"));
  m.def(
      "trimmed_mean",
      [](py::handle x, py::object trim, bool weighted) {
        Doubles a = column(x, "x");
        int status = 0;
        double r = kNaN;
        if (trim.is_none()) {
          r = released([&] { return qel::v1::GetLynTrimmedMean(a.data(), count(a), &status); });
        } else if (weighted) {
          std::vector<double> s = sortedCopy(a);
          r = qel::v1::LynTrimmedMeanOnSorted(s.data(), count(a), trim.cast<double>());
        } else {
          const double t = trim.cast<double>();
          r = released([&] { return qel::v1::GetTrimmedMean(a.data(), count(a), t, &status); });
        }
        check(status);
        return r;
      },
      py::arg("x"), py::arg("trim") = py::none(), py::arg("weighted") = false,
      "Trimmed mean: without trim the library's 5% rule; with trim, floor(n*trim) dropped at "
      "each end, or fractional end weights when weighted.");
  m.def(
      "mode",
      [](py::handle x, unsigned capacity) {
        Doubles a = column(x, "x");
        std::vector<double> modes(std::max(capacity, 1u));
        unsigned modeCount = 0, frequency = 0;
        check(released([&] {
          return qel::v1::GetMode(a.data(), count(a), modes.data(), capacity, &modeCount,
                                  &frequency);
        }));
        return result("Mode",
                      {{"modes", toArray(modes.data(), modeCount)}, {"frequency", u(frequency)}});
      },
      py::arg("x"), py::arg("capacity") = 5u, "The most frequent values (seen more than once).");
}

void registerSummaries(py::module_& m) {
  m.def(
      "five_number_summary",
      [](py::handle x) {
        Doubles a = column(x, "x");
        qel::v1::FiveNumberSummary s;
        check(released([&] { return qel::v1::GetLynFiveNumberSummary(&s, a.data(), count(a)); }));
        return fiveNumbers(s);
      },
      py::arg("x"), "Minimum, type-6 quartiles, median and maximum.");
  m.def(
      "extended_summary",
      [](py::handle x) {
        Doubles a = column(x, "x");
        qel::v1::SecondSampleMoments mo;
        mo.n = count(a);
        qel::v1::FiveNumberSummary s;
        double modes[5];
        unsigned modeCount = 0, frequency = 0;
        check(released([&] {
          return qel::v1::GetLyn2013ExtendedSummary(&mo, &s, modes, &modeCount, &frequency,
                                                    a.data());
        }));
        return result("ExtendedSummary", {{"n", u(mo.n)},
                                          {"mean", f(mo.mean)},
                                          {"variance", f(mo.variance)},
                                          {"sum", f(mo.sum)},
                                          {"sum_of_squares", f(mo.sumOfSquares)},
                                          {"five", fiveNumbers(s)},
                                          {"modes", toArray(modes, modeCount)},
                                          {"mode_frequency", u(frequency)}});
      },
      py::arg("x"));
  m.def(
      "boxplot",
      [](py::handle x, double confidence) {
        Doubles a = column(x, "x");
        qel::v1::LynBoxplotHelper b;
        check(released(
            [&] { return qel::v1::RunLynBoxplotHelper(&b, confidence, a.data(), count(a)); }));
        return result("Boxplot", {{"minimum", f(b.minimum)},
                                  {"maximum", f(b.maximum)},
                                  {"first_quartile", f(b.firstQuartile)},
                                  {"median", f(b.median)},
                                  {"third_quartile", f(b.thirdQuartile)},
                                  {"median_lower_limit", f(b.medianLowerLimit)},
                                  {"median_upper_limit", f(b.medianUpperLimit)},
                                  {"lower_hinge", f(b.lowerHinge)},
                                  {"upper_hinge", f(b.upperHinge)},
                                  {"mean", f(b.mean)},
                                  {"standard_deviation", f(b.standardDeviation)}});
      },
      py::arg("x"), py::arg("confidence") = 0.95,
      "What a boxplot draws, with the sign-test interval of the median.");
}

}  // namespace

void registerDescriptive(py::module_& m) {
  registerMoments(m);
  registerOrderStatistics(m);
  registerSummaries(m);
}

}  // namespace qelpy
