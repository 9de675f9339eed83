// Goodness of fit and probability plots (normal, lognormal, exponential,
// Weibull), maximum-likelihood fits, the polynomial curve fit and axis ticks.
#include <qel/axis_ticks.h>
#include <qel/curve_fit.h>
#include <qel/fits.h>

#include <algorithm>

#include "common.h"

namespace qelpy {

namespace {

py::object f(double v) {
  return py::float_(v);
}

enum class Law { Normal, LogNormal, Exponential, Weibull };

Law lawOf(const std::string& name) {
  if (name == "normal") return Law::Normal;
  if (name == "lognormal") return Law::LogNormal;
  if (name == "exponential") return Law::Exponential;
  if (name == "weibull") return Law::Weibull;
  throw py::value_error("dist must be normal, lognormal, exponential or weibull, not '" + name +
                        "'");
}

// Parameters of a law: one for the exponential, two otherwise.
std::size_t parameterCount(Law law) {
  return law == Law::Exponential ? 1 : 2;
}

qel::PlottingMethod methodOf(const std::string& name) {
  if (name == "median") return qel::kPlotMedianRank;
  if (name == "mean") return qel::kPlotMeanRank;
  if (name == "midpoint") return qel::kPlotMidpoint;
  if (name == "step") return qel::kPlotStep;
  throw py::value_error("method must be median, mean, midpoint or step, not '" + name + "'");
}

std::vector<double> sortedCopy(py::handle x) {
  Doubles a = column(x, "x");
  std::vector<double> s(a.data(), a.data() + a.size());
  py::gil_scoped_release release;
  std::sort(s.begin(), s.end());
  return s;
}

py::object probabilityPlot(py::handle x, const std::string& dist, const std::string& method) {
  const Law law = lawOf(dist);
  const qel::PlottingMethod pm = methodOf(method);
  std::vector<double> s = sortedCopy(x);
  const auto n = static_cast<unsigned>(s.size());
  std::vector<double> scores(n), probabilities(n), parameters(2, kNaN), covariances(3, kNaN);
  double ad = kNaN, p = kNaN;
  const int code = released([&] {
    double* a[] = {scores.data(), probabilities.data(), parameters.data(), covariances.data()};
    switch (law) {
      case Law::Normal:
        return qel::v1::RunLynNormalPPlot(s.data(), a[0], a[1], a[2], a[3], &ad, &p, n, pm);
      case Law::LogNormal:
        return qel::v1::RunLynLogNormalPPlot(s.data(), a[0], a[1], a[2], a[3], &ad, &p, n, pm);
      case Law::Exponential:
        return qel::v0::RunLynExponentialPPlot(s.data(), a[0], a[1], a[2], a[3], &ad, &p, n, pm);
      case Law::Weibull:
        return qel::v0::RunLynWeibullPPlot(s.data(), a[0], a[1], a[2], a[3], &ad, &p, n, pm);
    }
    return 0;
  });
  check(code);
  const std::size_t k = parameterCount(law);
  return result("ProbabilityPlot", {{"x", toArray(s.data(), n)},
                                    {"probabilities", toArray(probabilities.data(), n)},
                                    {"scores", toArray(scores.data(), n)},
                                    {"parameters", toArray(parameters.data(), k)},
                                    {"covariances", toArray(covariances.data(), k == 1 ? 1 : 3)},
                                    {"ad_statistic", f(ad)},
                                    {"ad_p_value", f(p)},
                                    {"status", py::int_(code)}});
}

py::object andersonDarling(py::handle x, const std::string& dist, py::handle parameters) {
  const Law law = lawOf(dist);
  Doubles given = column(parameters, "parameters");
  if (static_cast<std::size_t>(given.size()) != parameterCount(law)) {
    throw py::value_error("parameters: " + std::to_string(parameterCount(law)) + " for " + dist);
  }
  std::vector<double> s = sortedCopy(x);
  const auto n = static_cast<unsigned>(s.size());
  const double* g = given.data();
  double ad = kNaN, p = kNaN;
  const int code = released([&] {
    switch (law) {
      case Law::Normal:
        return qel::v1::RunLynNormalADTest(s.data(), g, &ad, &p, n);
      case Law::LogNormal:
        return qel::v1::RunLynLogNormalADTest(s.data(), g, &ad, &p, n);
      case Law::Exponential:
        return qel::v0::RunLynExponentialADTest(s.data(), g[0], &ad, &p, n);
      case Law::Weibull:
        return qel::v0::RunLynWeibullADTest(s.data(), g, &ad, &p, n);
    }
    return 0;
  });
  check(code);
  return result("AndersonDarling",
                {{"statistic", f(ad)}, {"p_value", f(p)}, {"status", py::int_(code)}});
}

py::object fit(py::handle x, const std::string& dist) {
  const Law law = lawOf(dist);
  Doubles a = column(x, "x");
  double parameters[2] = {kNaN, kNaN};
  const int code = released([&] {
    switch (law) {
      case Law::Normal:
        return qel::v2::FitLynNormal(a.data(), parameters, count(a));
      case Law::LogNormal:
        return qel::v2::FitLynLogNormal(a.data(), parameters, count(a));
      case Law::Exponential:
        return qel::v2::FitExponential(a.data(), parameters, count(a));
      case Law::Weibull:
        return qel::v2::FitWeibull(a.data(), parameters, count(a));
    }
    return 0;
  });
  check(code);
  return toArray(parameters, parameterCount(law));
}

py::object curveFit(py::handle x, py::handle y, unsigned degree, bool intercept, double tolerance) {
  Doubles a = column(x, "x"), b = column(y, "y");
  if (a.size() != b.size()) throw py::value_error("x and y must have the same length");
  std::vector<double> coefficients(degree + 2, kNaN);
  double r2 = kNaN;
  const int code = released([&] {
    return qel::v1::RunLynGrCurveFit(coefficients.data(), &r2, a.data(), b.data(), count(a), degree,
                                     tolerance, intercept);
  });
  check(code);
  return result("CurveFit", {{"coefficients", toArray(coefficients.data(), degree + 1)},
                             {"residual_sd", f(coefficients[degree + 1])},
                             {"r_squared", f(r2)},
                             {"status", py::int_(code)}});
}

using Pair = std::pair<double, double>;

py::object ticks(double low, double high, std::pair<int, int> count, Pair below, Pair above,
                 Pair limits, Pair tickMargins) {
  qel::deprecated::TickCalculationResult r;
  released([&] {
    qel::deprecated::ComputeTicks(&r, count.first, count.second, below.first, below.second,
                                  above.first, above.second, limits.first, limits.second,
                                  tickMargins.first, tickMargins.second, low, high);
  });
  std::vector<double> marks;
  for (int i = 0; i < r.tickCount; ++i) marks.push_back(r.firstTick + i * r.increment);
  return result("Ticks", {{"first", f(r.firstTick)},
                          {"last", f(r.lastTick)},
                          {"scale_minimum", f(r.scaleMinimum)},
                          {"scale_maximum", f(r.scaleMaximum)},
                          {"increment", f(r.increment)},
                          {"count", py::int_(r.tickCount)},
                          {"ticks", toArray(marks.data(), marks.size())}});
}

}  // namespace

void registerFits(py::module_& m) {
  m.def("probability_plot", &probabilityPlot, py::arg("x"), py::arg("dist") = "normal",
        py::arg("method") = "median",
        "Probability-plot data of a sample (sorted here): plotting positions, scores, fitted "
        "parameters with their covariances, and the Anderson-Darling statistic and P-value "
        "(status 10003/10004 when the P-value is a bound).");
  m.def("anderson_darling", &andersonDarling, py::arg("x"), py::arg("dist"), py::arg("parameters"),
        "Anderson-Darling test against the law with given parameters (normal, lognormal: "
        "location and scale; exponential: the mean; weibull: shape and scale).");
  m.def("fit", &fit, py::arg("x"), py::arg("dist") = "normal",
        "Maximum-likelihood parameters of normal, lognormal, exponential or weibull.");
  m.def(
      "plotting_positions",
      [](unsigned n, const std::string& method) {
        std::vector<double> p(n);
        check(qel::v1::CreatePointProbabilities(p.data(), n, methodOf(method)));
        return toArray(p.data(), n);
      },
      py::arg("n"), py::arg("method") = "median");
  m.def("curve_fit", &curveFit, py::arg("x"), py::arg("y"), py::arg("degree") = 1u,
        py::arg("intercept") = true, py::arg("tolerance") = 1e-12,
        "Least-squares polynomial: coefficients from the intercept (0 without it) up; "
        "collinear terms NaN.");
  m.def("ticks", &ticks, py::arg("low"), py::arg("high"), py::arg("count") = std::make_pair(4, 11),
        py::arg("below") = Pair(0.0, 0.05), py::arg("above") = Pair(0.0, 0.05),
        py::arg("limits") =
            Pair(-std::numeric_limits<double>::infinity(), std::numeric_limits<double>::infinity()),
        py::arg("tick_margins") = Pair(0.5, 0.5),
        "Ticks and extent of a graph axis for data from low to high.");
}

}  // namespace qelpy
