// Summary mode: the extended summary of a column of numbers (moments, the
// five numbers and up to five modes), one "name value" line each.
#include "summary_mode.h"

#include <qel/basic_types.h>
#include <qel/summaries.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <stdexcept>
#include <vector>

#include "charts.h"
#include "cli.h"
#include "domain.h"

namespace qelcalc {

namespace {

// The boxplot of the values from the library's boxplot helper.
void writeBoxplotPicture(const std::vector<double>& x, double confidence, const std::string& path) {
  BoxplotPicture picture;
  picture.title = "Boxplot";
  if (qel::v1::RunLynBoxplotHelper(&picture.box, confidence, x.data(),
                                   static_cast<unsigned int>(x.size())) != qel::qelOk)
    throw std::runtime_error("out of memory");
  picture.sorted = x;
  std::sort(picture.sorted.begin(), picture.sorted.end());
  picture.confidence = confidence;
  writeBoxplot(picture, path);
}

}  // namespace

void printSummaryUsage(std::ostream& out) {
  out << "  qelcalc summary FILE|- [--svg PICTURE [--confidence 0.95]]\n"
         "    Reads one number per line from FILE (or stdin for -) and writes n, mean,\n"
         "    stddev, variance, sum, minimum, q1, median, q3, maximum (type-6 quartiles),\n"
         "    modecount, modefrequency and one \"mode\" line per mode (at most five).\n"
         "    --svg also draws the boxplot: box from hinge to hinge, notched at the\n"
         "    median's interval (--confidence), whiskers and outliers (1.5 hinge spreads).\n";
}

int runSummaryMode(int argc, char** argv, std::ostream& out) {
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (args.positional.size() != 1 || !args.flags.empty()) {
    throw UsageError("summary takes exactly one FILE or -");
  }
  for (const auto& option : args.options) {
    if (option.first != "svg" && option.first != "confidence")
      throw UsageError("summary has no option --" + option.first);
  }
  if (args.options.count("confidence") && !args.options.count("svg"))
    throw UsageError("--confidence goes with --svg");
  const double confidence = domainOption(args, "confidence", 0.95, Domain::kLevel);
  const std::vector<double> x = readNumbers(args.positional[0]);
  if (x.size() > std::numeric_limits<unsigned int>::max()) throw UsageError("too many numbers");

  qel::v1::SecondSampleMoments moments;
  moments.n = static_cast<unsigned int>(x.size());
  qel::v1::FiveNumberSummary five;
  double modes[5];
  unsigned int modeCount = 0, frequency = 0;
  const int code =
      qel::v1::GetLyn2013ExtendedSummary(&moments, &five, modes, &modeCount, &frequency, x.data());
  if (code != qel::qelOk) throw std::runtime_error("out of memory");

  out << "n " << moments.n << "\n"
      << "mean " << formatNumber(moments.mean) << "\n"
      << "stddev " << formatNumber(std::sqrt(moments.variance)) << "\n"
      << "variance " << formatNumber(moments.variance) << "\n"
      << "sum " << formatNumber(moments.sum) << "\n"
      << "minimum " << formatNumber(five.minimum) << "\n"
      << "q1 " << formatNumber(five.firstQuartile) << "\n"
      << "median " << formatNumber(five.median) << "\n"
      << "q3 " << formatNumber(five.thirdQuartile) << "\n"
      << "maximum " << formatNumber(five.maximum) << "\n"
      << "modecount " << modeCount << "\n"
      << "modefrequency " << frequency << "\n";
  for (unsigned int i = 0; i < modeCount; ++i) out << "mode " << formatNumber(modes[i]) << "\n";
  if (args.options.count("svg")) writeBoxplotPicture(x, confidence, args.options.at("svg"));
  return 0;
}

}  // namespace qelcalc
