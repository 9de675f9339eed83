// Distribution mode: evaluates any exported density, cumulative probability
// or inverse, on one number or on a column read from a file or stdin.
#include "distribution_mode.h"

#include <qel/distributions.h>

#include <cmath>
#include <functional>
#include <vector>

#include "cli.h"
#include "domain.h"

namespace qelcalc {

namespace {

using Values = std::vector<double>;

struct Parameter {
  std::string name;
  double defaultValue;  // NaN: the parameter must be given
};

struct Family {
  std::string name;
  std::vector<Parameter> parameters;
  std::function<double(double, const Values&)> pdf;
  std::function<double(double, const Values&, bool)> cdf;
  std::function<double(double, const Values&)> inv;
  std::function<void(double*, const double*, unsigned long, const Values&)> pdfArray;
  std::function<void(double*, const double*, unsigned long, const Values&, bool)> cdfArray;
  std::function<void(double*, const double*, unsigned long, const Values&)> invArray;
};

// An integer parameter must be given as a whole number within int's range.
int toInt(double value, const char* name) {
  if (!(std::fabs(value) <= 2147483647.0) || value != std::floor(value)) {
    throw UsageError(std::string("--") + name + " must be a whole number");
  }
  return static_cast<int>(value);
}

// One entry per exported family, written by tools/codegen/gen_distribution_api.py
// from the same table as the library's declarations.
const std::vector<Family>& families() {
  static const std::vector<Family> table = {
#include "families_table.inc"
  };
  return table;
}

const Family* findFamily(const std::string& name) {
  for (const auto& f : families())
    if (f.name == name) return &f;
  return nullptr;
}

Values collectParameters(const Family& family, const Arguments& args) {
  Values values;
  for (const auto& p : family.parameters) {
    const auto it = args.options.find(p.name);
    if (it != args.options.end()) {
      values.push_back(checkParameter(parseNumber(it->second, "--" + p.name), p.name));
    } else if (std::isnan(p.defaultValue)) {
      throw UsageError(family.name + " needs --" + p.name);
    } else {
      values.push_back(p.defaultValue);
    }
  }
  for (const auto& option : args.options) {
    if (option.first == "file") continue;
    bool known = false;
    for (const auto& p : family.parameters) known = known || p.name == option.first;
    if (!known) throw UsageError(family.name + " has no parameter --" + option.first);
  }
  return values;
}

}  // namespace

bool isDistributionFamily(const std::string& name) {
  return findFamily(name) != nullptr;
}

void printDistributionUsage(std::ostream& out) {
  out << "  qelcalc FAMILY pdf|cdf|inv [X] [--PARAM VALUE ...] [--upper|--upper-tail] [--file "
         "PATH|-]\n"
         "    Without X, reads one number per line from --file (or stdin) and writes one\n"
         "    result per line. --upper (or --upper-tail, for families with a parameter\n"
         "    named upper) gives the upper tail. Families and parameters (defaults in\n"
         "    brackets):\n";
  for (const auto& f : families()) {
    out << "      " << f.name << ":";
    for (const auto& p : f.parameters) {
      out << " --" << p.name;
      if (!std::isnan(p.defaultValue)) out << " [" << formatNumber(p.defaultValue) << "]";
    }
    out << "\n";
  }
}

bool hasParameter(const Family& family, const std::string& name) {
  for (const auto& p : family.parameters)
    if (p.name == name) return true;
  return false;
}

int runDistributionMode(int argc, char** argv, std::ostream& out) {
  const Family* family = argc > 1 ? findFamily(argv[1]) : nullptr;
  if (!family) throw UsageError("unknown family '" + std::string(argc > 1 ? argv[1] : "") + "'");
  // --upper asks for the upper tail, unless the family has a parameter of that
  // name (Triangular, Uniform); --upper-tail works everywhere.
  std::vector<std::string> flagNames = {"upper-tail"};
  if (!hasParameter(*family, "upper")) flagNames.push_back("upper");
  const Arguments args = parseArguments(argc, argv, 1, flagNames);
  if (args.positional.size() < 2) throw UsageError("expected FAMILY and FUNCTION");
  const std::string& function = args.positional[1];
  if (function != "pdf" && function != "cdf" && function != "inv") {
    throw UsageError("unknown function '" + function + "' (use pdf, cdf or inv)");
  }
  if (args.positional.size() > 3) throw UsageError("too many arguments");
  const bool upper = !args.flags.empty();
  if (upper && function != "cdf") throw UsageError("the upper tail goes with cdf only");
  const Values params = collectParameters(*family, args);

  if (args.positional.size() == 3) {
    if (args.options.count("file")) throw UsageError("give either X or --file, not both");
    double x = parseNumber(args.positional[2], "X");
    if (function == "inv") x = checkDomain(x, "X", Domain::kProbability);
    double result;
    if (function == "pdf") {
      result = family->pdf(x, params);
    } else if (function == "cdf") {
      result = family->cdf(x, params, upper);
    } else {
      result = family->inv(x, params);
    }
    out << formatNumber(result) << "\n";
    return 0;
  }

  const auto fileOption = args.options.find("file");
  Values column = readNumbers(fileOption == args.options.end() ? "-" : fileOption->second);
  // The array forms may write in place.
  if (function == "pdf") {
    family->pdfArray(column.data(), column.data(), column.size(), params);
  } else if (function == "cdf") {
    family->cdfArray(column.data(), column.data(), column.size(), params, upper);
  } else {
    family->invArray(column.data(), column.data(), column.size(), params);
  }
  for (double v : column) out << formatNumber(v) << "\n";
  return 0;
}

}  // namespace qelcalc
