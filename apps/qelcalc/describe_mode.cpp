// Describe mode: summary statistics of a column of numbers read from a file
// or stdin, one "name value" line each.
#include "describe_mode.h"

#include <qel/descriptive.h>

#include <cmath>
#include <limits>
#include <vector>

#include "cli.h"

namespace qelcalc {

void printDescribeUsage(std::ostream& out) {
  out << "  qelcalc describe [--file PATH|-]\n"
         "    Reads one number per line from --file (or stdin) and writes n, mean, stddev,\n"
         "    skewness, kurtosis (excess) and sum, one \"name value\" per line.\n";
}

int runDescribeMode(int argc, char** argv, std::ostream& out) {
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (!args.positional.empty()) throw UsageError("describe takes no arguments besides --file");
  for (const auto& option : args.options)
    if (option.first != "file") throw UsageError("describe has no option --" + option.first);
  const auto file = args.options.find("file");
  const std::vector<double> x = readNumbers(file == args.options.end() ? "-" : file->second);
  if (x.size() > std::numeric_limits<unsigned int>::max()) throw UsageError("too many numbers");
  const auto n = static_cast<unsigned int>(x.size());

  double mean, variance, skewness, kurtosis;
  qel::v1::GetSampleMeanAndVariance(x.data(), n, &mean, &variance);
  qel::v1::GetLynSkewnessAndKurtosis(x.data(), n, &skewness, &kurtosis);
  const double sum = qel::v1::GetSum(x.data(), n);

  out << "n " << n << "\n"
      << "mean " << formatNumber(mean) << "\n"
      << "stddev " << formatNumber(std::sqrt(variance)) << "\n"
      << "skewness " << formatNumber(skewness) << "\n"
      << "kurtosis " << formatNumber(kurtosis) << "\n"
      << "sum " << formatNumber(sum) << "\n";
  return 0;
}

}  // namespace qelcalc
