// gof mode: the chi-square goodness-of-fit test of a column of category
// counts against given or equal proportions.
#include "gof_mode.h"

#include <qel/tabular_gof.h>

#include <limits>
#include <sstream>
#include <string>
#include <vector>

#include "cli.h"
#include "test_input.h"

namespace qelcalc {

// Comma-separated numbers, as many as the option asks for (0: any number).
std::vector<double> numberList(const std::string& text, const std::string& what,
                               std::size_t count) {
  std::vector<double> values;
  std::stringstream in(text);
  for (std::string item; std::getline(in, item, ',');) values.push_back(parseNumber(item, what));
  if (values.empty() || (count != 0 && values.size() != count)) {
    throw UsageError(what + ": expected " +
                     (count ? std::to_string(count) + " comma-separated numbers" : "numbers"));
  }
  return values;
}

void printGofUsage(std::ostream& out) {
  out << "  qelcalc gof FILE|- [--proportions P1,P2,...]\n"
         "    Chi-square goodness of fit of category counts (one a line) against the\n"
         "    proportions (equal ones by default): expected count and contribution per\n"
         "    category, then statistic, df and P.\n";
}

int runGofMode(int argc, char** argv, std::ostream& out) {
  if (argc == 3 && std::string(argv[2]) == "--help") {
    printGofUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (args.positional.size() != 1) throw UsageError("gof takes one file of counts (or -)");
  for (const auto& option : args.options) {
    if (option.first != "proportions") throw UsageError("gof has no option --" + option.first);
  }
  const std::vector<double> counts = readNumbers(args.positional[0]);
  if (counts.empty()) throw UsageError("no counts in '" + args.positional[0] + "'");
  if (counts.size() > std::numeric_limits<unsigned>::max()) throw UsageError("too many counts");
  std::vector<double> proportions;
  if (args.options.count("proportions")) {
    proportions = numberList(args.options.at("proportions"), "--proportions", counts.size());
  }
  double total = 0.0;
  for (double c : counts) total += c;
  std::vector<double> expected(counts.size()), contributions(counts.size());
  double statistic = 0.0, p = 0.0, df = 0.0;
  qel::RunLynTabularChiSqGOFTest(counts.data(), proportions.empty() ? nullptr : proportions.data(),
                                 expected.data(), contributions.data(), &statistic, &p, &df, total,
                                 static_cast<unsigned>(counts.size()));
  for (std::size_t i = 0; i < counts.size(); ++i) {
    out << "category " << i + 1 << " " << formatNumber(expected[i]) << " "
        << formatNumber(contributions[i]) << "\n";
  }
  writeField(out, "statistic", statistic);
  writeField(out, "df", df);
  writeField(out, "p", p);
  return 0;
}

}  // namespace qelcalc
