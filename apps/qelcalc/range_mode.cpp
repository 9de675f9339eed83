// range mode: the distribution of the range of k independent standard
// normal variables (the normal range with known sigma).
#include <string>

#include "cli.h"
#include "quad_mode.h"
#include "test_input.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/normal_range.h"

namespace qelcalc {

void printRangeUsage(std::ostream& out) {
  out << "  qelcalc range cdf|inv|crit|pvalue X --k K [--upper]\n"
         "    The range of K standard normal variables: P(R <= X) (P(R > X) with\n"
         "    --upper), the quantile at probability X, the critical value at level X,\n"
         "    the P-value of a range X. Each tail keeps its relative accuracy.\n";
}

int runRangeMode(int argc, char** argv, std::ostream& out) {
  if (argc == 3 && std::string(argv[2]) == "--help") {
    printRangeUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {"upper"});
  if (args.positional.size() != 2) throw UsageError("range takes a function and X");
  for (const auto& option : args.options) {
    if (option.first != "k") throw UsageError("range has no option --" + option.first);
  }
  if (!args.options.count("k")) throw UsageError("range needs --k");
  const double k = parseNumber(args.options.at("k"), "--k");
  if (!(k >= 2 && k <= 1e6) || k != static_cast<int>(k))
    throw UsageError("--k: a whole number from 2 to 1000000");
  const std::string& what = args.positional[0];
  const double x = parseNumber(args.positional[1], "X");
  const bool upper = !args.flags.empty();
  if (upper && what != "cdf") throw UsageError("--upper goes with cdf");
  const int n = static_cast<int>(k);
  double result;
  if (what == "cdf") {
    result = qel::mNormalRangeCdf(x, n, upper);
  } else if (what == "inv") {
    result = qel::mNormalRangeInvCdf(x, n);
  } else if (what == "crit") {
    result = qel::mNormalRangeCritValue(x, n);
  } else if (what == "pvalue") {
    result = qel::mNormalRangePValue(x, n);
  } else {
    throw UsageError("unknown range function '" + what + "' (cdf, inv, crit, pvalue)");
  }
  writeField(out, what, qel::mIsNumericMissing(result) ? qel::mQuietNaN() : result);
  return 0;
}

}  // namespace qelcalc
