// Fit and probability-plot modes: a column of numbers is sorted, the chosen
// distribution is fitted by maximum likelihood, and either the parameters
// with their covariances and the Anderson-Darling test are printed (fit), or
// the plot data are written as CSV (pplot): the sorted value, its plotting
// position, its score, and the fitted line at the value in score units.
#include "fit_mode.h"

#include <qel/distributions.h>
#include <qel/fits.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <limits>
#include <string>
#include <vector>

#include "charts.h"
#include "cli.h"

namespace qelcalc {
namespace {

struct Plot {
  std::string dist;
  std::vector<double> x;  // sorted
  std::vector<double> scores, probabilities;
  double parameters[2] = {0, 0};
  double covariances[3] = {0, 0, 0};
  double statistic = 0, pValue = 0;
  int status = 0;
};

qel::PlottingMethod parseMethod(const std::string& name) {
  if (name == "median") return qel::kPlotMedianRank;
  if (name == "mean") return qel::kPlotMeanRank;
  if (name == "midpoint") return qel::kPlotMidpoint;
  if (name == "step") return qel::kPlotStep;
  throw UsageError("unknown --method '" + name + "' (median, mean, midpoint or step)");
}

// Reads FILE (positional) with --dist, --method and, for pplot, --out and
// --svg (paths[0] and paths[1]).
Plot makePlot(int argc, char** argv, bool allowOut, std::string* paths) {
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (args.positional.size() != 1) throw UsageError("expected one FILE argument (or -)");
  std::string method = "median";
  Plot plot;
  for (const auto& option : args.options) {
    if (option.first == "dist") {
      plot.dist = option.second;
    } else if (option.first == "method") {
      method = option.second;
    } else if (option.first == "out" && allowOut) {
      paths[0] = option.second;
    } else if (option.first == "svg" && allowOut) {
      paths[1] = option.second;
    } else {
      throw UsageError(std::string(argv[1]) + " has no option --" + option.first);
    }
  }
  if (plot.dist != "normal" && plot.dist != "lognormal" && plot.dist != "exponential" &&
      plot.dist != "weibull")
    throw UsageError("--dist must be normal, lognormal, exponential or weibull");
  plot.x = readNumbers(args.positional[0]);
  if (plot.x.size() > std::numeric_limits<unsigned>::max()) throw UsageError("too many numbers");
  std::sort(plot.x.begin(), plot.x.end());
  const auto n = static_cast<unsigned>(plot.x.size());
  plot.scores.resize(n);
  plot.probabilities.resize(n);
  const qel::PlottingMethod m = parseMethod(method);
  double* p = plot.parameters;
  double* c = plot.covariances;
  if (plot.dist == "normal")
    plot.status =
        qel::v1::RunLynNormalPPlot(plot.x.data(), plot.scores.data(), plot.probabilities.data(), p,
                                   c, &plot.statistic, &plot.pValue, n, m);
  else if (plot.dist == "lognormal")
    plot.status =
        qel::v1::RunLynLogNormalPPlot(plot.x.data(), plot.scores.data(), plot.probabilities.data(),
                                      p, c, &plot.statistic, &plot.pValue, n, m);
  else if (plot.dist == "exponential")
    plot.status = qel::v0::RunLynExponentialPPlot(plot.x.data(), plot.scores.data(),
                                                  plot.probabilities.data(), p, c, &plot.statistic,
                                                  &plot.pValue, n, m);
  else
    plot.status =
        qel::v0::RunLynWeibullPPlot(plot.x.data(), plot.scores.data(), plot.probabilities.data(), p,
                                    c, &plot.statistic, &plot.pValue, n, m);
  return plot;
}

// The fitted line in score units: the normal quantile scale for the normal
// and lognormal, log(-log(1 - F)) for the exponential and Weibull.
double fittedScore(const Plot& plot, double x) {
  const double* p = plot.parameters;
  if (plot.dist == "normal") return (x - p[0]) / p[1];
  if (plot.dist == "lognormal") return (std::log(x) - p[0]) / p[1];
  if (plot.dist == "exponential") return std::log(x / p[0]);
  return p[0] * std::log(x / p[1]);
}

std::string statusText(int status) {
  if (status == qel::qelWarnADPValueUpperBound) return "10003 (the P-value is an upper bound)";
  if (status == qel::qelWarnADPValueLowerBound) return "10004 (the P-value is a lower bound)";
  return std::to_string(status);
}

}  // namespace

void printFitUsage(std::ostream& out) {
  out << "  qelcalc fit FILE|- --dist normal|lognormal|exponential|weibull\n"
         "    Maximum-likelihood fit of a column of numbers: the parameters, their\n"
         "    covariances and the Anderson-Darling statistic and P-value.\n"
         "  qelcalc pplot FILE|- --dist D [--method median|mean|midpoint|step] [--out CSV]\n"
         "                [--svg PICTURE]\n"
         "    Probability-plot data as CSV (x,probability,score,fitted), to --out or stdout;\n"
         "    --svg also draws the plot (points, fitted line, percent scale, AD test).\n";
}

namespace {

// A number of a note: four significant digits.
std::string shortNumber(double v) {
  char buffer[32];
  std::snprintf(buffer, sizeof buffer, "%.4g", v);
  return std::isfinite(v) ? buffer : formatNumber(v);
}

// The probability plot as a picture: data on a log axis where the score is
// linear in log x; the probability axis in normal scores for the normal and
// lognormal, in log(-log(1 - p)) for the exponential and Weibull.
void writePlotPicture(const Plot& plot, const std::string& path) {
  ProbabilityPlotPicture picture;
  const bool normal = plot.dist == "normal" || plot.dist == "lognormal";
  std::string name = plot.dist;
  name[0] = static_cast<char>(name[0] - 'a' + 'A');
  picture.title = name + " probability plot";
  picture.x = plot.x;
  picture.scores = plot.scores;
  picture.logAxis = plot.dist != "normal";
  picture.fitted = [&plot](double x) { return fittedScore(plot, x); };
  if (normal)
    picture.scoreOf = [](double p) { return qel::NormalInvCdf(p, 0.0, 1.0); };
  else
    picture.scoreOf = [](double p) { return std::log(-std::log1p(-p)); };
  const char* bound = plot.status == qel::qelWarnADPValueUpperBound   ? " <= "
                      : plot.status == qel::qelWarnADPValueLowerBound ? " >= "
                                                                      : " = ";
  picture.notes = {"n = " + std::to_string(plot.x.size()), "AD = " + shortNumber(plot.statistic),
                   "P-value" + std::string(bound) + shortNumber(plot.pValue)};
  const double* q = plot.parameters;
  if (plot.dist == "normal")
    picture.notes.push_back("mean " + shortNumber(q[0]) + ", stddev " + shortNumber(q[1]));
  else if (plot.dist == "lognormal")
    picture.notes.push_back("location " + shortNumber(q[0]) + ", scale " + shortNumber(q[1]));
  else if (plot.dist == "exponential")
    picture.notes.push_back("scale " + shortNumber(q[0]));
  else
    picture.notes.push_back("shape " + shortNumber(q[0]) + ", scale " + shortNumber(q[1]));
  writeProbabilityPlot(picture, path);
}

}  // namespace

int runFitMode(int argc, char** argv, std::ostream& out) {
  const Plot plot = makePlot(argc, argv, false, nullptr);
  const bool two = plot.dist != "exponential";
  const char* names[4][2] = {
      {"mean", "stddev"}, {"location", "scale"}, {"scale", ""}, {"shape", "scale"}};
  const int k = plot.dist == "normal" ? 0 : plot.dist == "lognormal" ? 1 : two ? 3 : 2;
  out << "n " << plot.x.size() << "\n";
  out << names[k][0] << " " << formatNumber(plot.parameters[0]) << "\n";
  if (two) {
    out << names[k][1] << " " << formatNumber(plot.parameters[1]) << "\n";
    out << "var_" << names[k][0] << " " << formatNumber(plot.covariances[0]) << "\n";
    out << "cov " << formatNumber(plot.covariances[1]) << "\n";
    out << "var_" << names[k][1] << " " << formatNumber(plot.covariances[2]) << "\n";
  } else {
    out << "var_scale " << formatNumber(plot.covariances[0]) << "\n";
  }
  out << "ad_statistic " << formatNumber(plot.statistic) << "\n"
      << "ad_pvalue " << formatNumber(plot.pValue) << "\n"
      << "status " << statusText(plot.status) << "\n";
  return 0;
}

int runPPlotMode(int argc, char** argv, std::ostream& out) {
  std::string paths[2];
  const Plot plot = makePlot(argc, argv, true, paths);
  const std::string& outPath = paths[0];
  if (!paths[1].empty()) writePlotPicture(plot, paths[1]);
  std::ofstream file;
  std::ostream* sink = &out;
  if (!outPath.empty()) {
    file.open(outPath);
    if (!file) throw UsageError("cannot write file '" + outPath + "'");
    sink = &file;
  }
  *sink << "x,probability,score,fitted\n";
  for (std::size_t i = 0; i < plot.x.size(); ++i)
    *sink << formatNumber(plot.x[i]) << "," << formatNumber(plot.probabilities[i]) << ","
          << formatNumber(plot.scores[i]) << "," << formatNumber(fittedScore(plot, plot.x[i]))
          << "\n";
  if (!*sink) throw UsageError("error while writing the plot data");
  return 0;
}

}  // namespace qelcalc
