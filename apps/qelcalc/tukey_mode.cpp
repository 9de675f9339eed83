// tukey mode: the studentized range (Tukey's multiple comparisons), its
// P-value and its critical value, and whether the critical value is trusted.
#include <ostream>
#include <string>

#include "cli.h"
#include "domain.h"
#include "qel/distributions.h"
#include "quad_mode.h"
#include "test_input.h"
#include "utilities/LYNBasicTypes.h"

namespace qelcalc {

void printTukeyUsage(std::ostream& out) {
  out << "  qelcalc tukey crit|pvalue X --k K --df D\n"
         "    The studentized range of K means with D degrees of freedom: the critical\n"
         "    value at level X (two decimals) or the P-value of a range X, and whether\n"
         "    the critical value at that level is trusted (possible true|false).\n"
         "    A value the library cannot give prints 'missing'.\n";
}

int runTukeyMode(int argc, char** argv, std::ostream& out) {
  if (argc == 3 && std::string(argv[2]) == "--help") {
    printTukeyUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (args.positional.size() != 2) throw UsageError("tukey takes crit or pvalue and X");
  for (const auto& option : args.options) {
    if (option.first != "k" && option.first != "df")
      throw UsageError("tukey has no option --" + option.first);
  }
  if (!args.options.count("k") || !args.options.count("df"))
    throw UsageError("tukey needs --k and --df");
  const double k = parseNumber(args.options.at("k"), "--k");
  if (!(k >= 2 && k <= 1e6) || k != static_cast<int>(k))
    throw UsageError("--k: a whole number from 2 to 1000000");
  const double df = checkParameter(parseNumber(args.options.at("df"), "--df"), "df");
  const std::string& what = args.positional[0];
  const double x = parseNumber(args.positional[1], "X");
  const int n = static_cast<int>(k);
  double result;
  bool possible;
  if (what == "crit") {
    if (!(x > 0 && x < 1)) throw UsageError("X: a level between 0 and 1");
    result = qel::GetStudentizedRangeCritValue(x, n, df);
    possible = qel::IsStudentizedRangePossible(n, df, x);
  } else if (what == "pvalue") {
    result = qel::GetStudentizedRangePValue(x, n, df);
    possible =
        qel::IsStudentizedRangePossible(n, df, qel::mIsNumericMissing(result) ? 0.05 : result);
  } else {
    throw UsageError("unknown tukey function '" + what + "' (crit, pvalue)");
  }
  if (qel::mIsNumericMissing(result)) {
    out << what << " missing\n";
  } else {
    writeField(out, what, result);
  }
  out << "possible " << (possible ? "true" : "false") << "\n";
  return 0;
}

}  // namespace qelcalc
