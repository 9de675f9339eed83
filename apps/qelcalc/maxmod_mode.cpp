// maxmod mode: the studentized maximum modulus (two-sided) or maximum
// (one-sided) of normal variables with correlations lambda_i lambda_j, its
// P-value and its critical value, and whether the critical value is trusted.
#include "maxmod_mode.h"

#include <cmath>
#include <sstream>
#include <string>
#include <vector>

#include "cli.h"
#include "qel/distributions.h"
#include "test_input.h"
#include "utilities/LYNBasicTypes.h"

namespace qelcalc {
namespace {

std::vector<double> parseLambdas(const std::string& text) {
  std::vector<double> lambdas;
  std::stringstream in(text);
  std::string item;
  while (std::getline(in, item, ',')) {
    const double value = parseNumber(item, "--lambdas");
    if (!(std::fabs(value) < 1)) throw UsageError("--lambdas: each value inside (-1, 1)");
    lambdas.push_back(value);
  }
  if (lambdas.empty() || text.back() == ',')
    throw UsageError("--lambdas: a comma-separated list of numbers");
  if (lambdas.size() > 1000000) throw UsageError("--lambdas: at most 1000000 values");
  return lambdas;
}

}  // namespace

void printMaxModUsage(std::ostream& out) {
  out << "  qelcalc maxmod crit|pvalue X --df D --lambdas L1,L2,... [--one-sided]\n"
         "    The studentized maximum modulus (with --one-sided: the studentized maximum)\n"
         "    of normal variables with correlations Li*Lj (|Li| < 1; 0.7071 for\n"
         "    comparisons with one control) over an estimate of sigma with D degrees of\n"
         "    freedom (inf: sigma known): the critical value at level X (two decimals)\n"
         "    or the P-value of X, and whether the critical value at that level is\n"
         "    trusted (possible true|false). A value the library cannot give prints\n"
         "    'missing'.\n";
}

int runMaxModMode(int argc, char** argv, std::ostream& out) {
  if (argc == 3 && std::string(argv[2]) == "--help") {
    printMaxModUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {"one-sided"});
  if (args.positional.size() != 2) throw UsageError("maxmod takes crit or pvalue and X");
  for (const auto& option : args.options) {
    if (option.first != "df" && option.first != "lambdas")
      throw UsageError("maxmod has no option --" + option.first);
  }
  if (!args.options.count("df") || !args.options.count("lambdas"))
    throw UsageError("maxmod needs --df and --lambdas");
  const double df = parseNumber(args.options.at("df"), "--df");
  if (!(df > 0)) throw UsageError("--df: a positive number or inf");
  const std::vector<double> lambdas = parseLambdas(args.options.at("lambdas"));
  const bool oneSided = !args.flags.empty();
  const unsigned count = static_cast<unsigned>(lambdas.size());
  const int k = static_cast<int>(count);
  const std::string& what = args.positional[0];
  const double x = parseNumber(args.positional[1], "X");
  double result;
  if (what == "crit") {
    if (!(x > 0 && x < 1)) throw UsageError("X: a level between 0 and 1");
    result = oneSided ? qel::GetStudentizedMaximumCritValue(x, df, lambdas.data(), count)
                      : qel::GetStudentizedMaximumModulusCritValue(x, df, lambdas.data(), count);
  } else if (what == "pvalue") {
    result = oneSided ? qel::GetStudentizedMaximumPValue(x, df, lambdas.data(), count)
                      : qel::GetStudentizedMaximumModulusPValue(x, df, lambdas.data(), count);
  } else {
    throw UsageError("unknown maxmod function '" + what + "' (crit, pvalue)");
  }
  const bool missing = qel::mIsNumericMissing(result);
  const double alpha = what == "crit" ? x : missing ? 0.05 : result;
  const bool possible = oneSided ? qel::IsStudentizedMaximumPossible(k, df, alpha)
                                 : qel::IsStudentizedMaximumModulusPossible(k, df, alpha);
  if (missing) {
    out << what << " missing\n";
  } else {
    writeField(out, what, result);
  }
  out << "possible " << (possible ? "true" : "false") << "\n";
  return 0;
}

}  // namespace qelcalc
