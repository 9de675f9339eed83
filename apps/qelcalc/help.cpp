#include "help.h"

#include <iostream>
#include <map>
#include <sstream>
#include <string>

#include "cli.h"
#include "distribution_mode.h"

namespace qelcalc {
namespace {

// One example per mode, runnable as it stands in a POSIX shell.
const std::map<std::string, std::string>& examples() {
  static const std::map<std::string, std::string> table = {
      {"FAMILY", "qelcalc normal cdf 1.96 --upper"},
      {"pvalue", "qelcalc pvalue t 2.1 --df 15"},
      {"crit", "qelcalc crit t 0.05 --df 15"},
      {"describe", "printf '2\\n4\\n4\\n5\\n7\\n9\\n' | qelcalc describe"},
      {"sample", "qelcalc sample normal 3 --mean 10 --sd 2 --seed 42"},
      {"ttest", "printf '5.1\\n4.9\\n5.6\\n5.8\\n6.0\\n' | qelcalc ttest - --mu 5"},
      {"test",
       "printf '5.1,4.8\\n4.9,5.0\\n5.6,5.1\\n5.8,5.2\\n' | qelcalc test wilcoxon - "
       "--column 1 --column2 2"},
      {"fit", "printf '1.2\\n2.3\\n2.9\\n3.4\\n4.8\\n' | qelcalc fit - --dist normal"},
      {"pplot",
       "printf '1.2\\n2.3\\n2.9\\n3.4\\n4.8\\n' | qelcalc pplot - --dist normal "
       "--svg plot.svg"},
      {"curvefit", "printf '1 2.1\\n2 3.9\\n3 6.2\\n4 7.8\\n' | qelcalc curvefit -"},
      {"summary", "printf '3\\n5\\n4\\n6\\n5\\n19\\n' | qelcalc summary - --svg box.svg"},
      {"table", "printf '10 20\\n30 25\\n' | qelcalc table - --want chisq,fisher"},
      {"matrix", "printf '4 2\\n2 3\\n' | qelcalc matrix chol -"},
      {"power", "qelcalc power t --n 10,20 --effect 1 --sigma 2"},
      {"gof", "printf '18\\n22\\n20\\n' | qelcalc gof -"},
      {"ticks", "qelcalc ticks 3.2 97.5"},
      {"quad", "qelcalc quad legendre 4"},
      {"sint", "qelcalc sint 20 --confidence 0.95"},
      {"range", "qelcalc range cdf 3.5 --k 4"},
      {"sort", "printf '2 5\\n1 7\\n2 3\\n' | qelcalc sort - --by 1,-2"},
      {"group", "printf '1,10\\n2,20\\n1,30\\n' | qelcalc group - --by 1 --value-column 2"},
      {"ranks", "printf '3\\n1\\n2\\n1\\n' | qelcalc ranks -"},
      {"tukey", "qelcalc tukey crit 0.05 --k 3 --df 12"},
      {"maxmod", "qelcalc maxmod crit 0.05 --df 20 --lambdas 0.7071,0.7071,0.7071,0.7071"},
  };
  return table;
}

// The word after "  qelcalc " that names a usage block.
std::string blockMode(const std::string& line) {
  const std::string lead = "  qelcalc ";
  if (line.compare(0, lead.size(), lead) != 0) return "";
  const auto end = line.find(' ', lead.size());
  return line.substr(lead.size(), end == std::string::npos ? end : end - lead.size());
}

bool isHelpWord(const std::string& word) {
  return word == "--help" || word == "-h";
}

// Answers "help [MODE]" and "MODE ... --help"; -1 for any other invocation.
int answerHelp(int argc, char** argv, UsagePrinter printUsage) {
  if (argc < 2) return -1;
  const std::string first = argv[1];
  bool asked = first == "help";
  for (int i = 2; i < argc && !asked; ++i) asked = isHelpWord(argv[i]);
  if (!asked || isHelpWord(first)) return -1;
  std::ostringstream usage;
  printUsage(usage);
  if (first == "help" && argc == 2) {
    std::cout << usage.str();
    return 0;
  }
  const std::string mode = first == "help" ? argv[2] : first;
  if (first == "help" && argc > 3) throw UsageError("help takes one MODE");
  if (!printModeHelp(isDistributionFamily(mode) ? "FAMILY" : mode, usage.str(), std::cout))
    throw UsageError("no help for " + quoted(mode) + " (see qelcalc --help)");
  return 0;
}

}  // namespace

bool printModeHelp(const std::string& mode, const std::string& fullUsage, std::ostream& out) {
  std::istringstream in(fullUsage);
  std::string text;
  bool inside = false, any = false;
  for (std::string line; std::getline(in, line);) {
    const std::string owner = blockMode(line);
    if (!owner.empty()) inside = owner == mode;
    // A block ends at the next line that is not indented beyond "  ".
    if (owner.empty() && line.compare(0, 3, "   ") != 0) inside = false;
    if (inside) text += line + "\n";
    any = any || inside;
  }
  if (!any) return false;
  out << "usage:\n" << text;
  const auto example = examples().find(mode);
  if (example != examples().end()) out << "example:\n  " << example->second << "\n";
  return true;
}

int runGlobalOptions(int& argc, char** argv, UsagePrinter printUsage) {
  try {
    argc = takeGlobalOptions(argc, argv);
    return answerHelp(argc, argv, printUsage);
  } catch (const UsageError& e) {
    std::cerr << "qelcalc: " << e.what() << "\n";
    return 2;
  }
}

}  // namespace qelcalc
