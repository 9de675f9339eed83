// The pictures of qelcalc, written as standalone SVG: the probability plot
// of pplot and the notched boxplot of summary.
#ifndef QELCALC_CHARTS_H
#define QELCALC_CHARTS_H

#include <qel/summaries.h>

#include <functional>
#include <string>
#include <vector>

namespace qelcalc {

struct ProbabilityPlotPicture {
  std::string title;
  std::vector<double> x;                  // sorted data
  std::vector<double> scores;             // the score of each point's plotting position
  bool logAxis = false;                   // data on a logarithmic axis (lognormal, Weibull, ...)
  std::function<double(double)> fitted;   // the fitted line: score at a data value
  std::function<double(double)> scoreOf;  // score of a probability in (0, 1)
  std::vector<std::string> notes;         // lines of the corner box
};

// Points, fitted line, data axis with the library's ticks, probability axis
// labelled in percent, notes in the upper left corner.
void writeProbabilityPlot(const ProbabilityPlotPicture& picture, const std::string& path);

struct BoxplotPicture {
  std::string title;
  qel::v1::LynBoxplotHelper box;
  std::vector<double> sorted;
  double confidence = 0.95;  // of the median's interval (the notch)
};

// Box from hinge to hinge notched at the median's interval, whiskers to the
// most extreme values within 1.5 hinge spreads of the hinges, the values
// beyond them as outliers.
void writeBoxplot(const BoxplotPicture& picture, const std::string& path);

}  // namespace qelcalc

#endif
