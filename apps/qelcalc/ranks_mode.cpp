// ranks mode: the rank of every value of a file, missing cells left out.
#include "ranks_mode.h"

#include <string>
#include <vector>

#include "cli.h"
#include "proxies/rows.h"
#include "test_input.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"

namespace qelcalc {

void printRanksUsage(std::ostream& out) {
  out << "  qelcalc ranks FILE [--descending] [--ties average|first]\n"
         "    The rank of each value (first column, one row a line), smallest first or\n"
         "    with --descending largest first; ties share their mean rank, or with\n"
         "    --ties first are ranked in row order (ascending; the reverse descending).\n"
         "    A cell '*' or 'NA' is missing: left out of the ranking, printed as '*'.\n";
}

int runRanksMode(int argc, char** argv, std::ostream& out) {
  if (argc == 3 && std::string(argv[2]) == "--help") {
    printRanksUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {"descending"});
  if (args.positional.size() != 1) throw UsageError("ranks takes one FILE");
  for (const auto& option : args.options) {
    if (option.first != "ties") throw UsageError("ranks has no option --" + option.first);
  }
  const std::string ties = args.options.count("ties") ? args.options.at("ties") : "average";
  if (ties != "average" && ties != "first") throw UsageError("--ties: average or first");
  const bool descending = !args.flags.empty();
  std::vector<double> values;
  for (const TableRow& row : readTableRows(args.positional[0])) {
    const std::string& cell = row.fields.empty() ? std::string() : row.fields.front();
    const bool missing = cell.empty() || cell == "*" || cell == "NA";
    values.push_back(missing ? qel::mGetMissingValueCode()
                             : parseNumber(cell, "line " + std::to_string(row.lineNumber)));
    if (!missing && qel::mIsNumericMissing(values.back()))
      throw UsageError("line " + std::to_string(row.lineNumber) +
                       ": 1.23456e30 is the missing-value code");
  }
  if (values.empty()) throw UsageError("no values in " + args.positional[0]);
  std::vector<double> ranks;
  qel::CbRows sorted;
  qel::mComputeRanks(values, ranks, sorted, ties == "average", !descending);
  qel::mAdjustRanksForMisingValues(values, sorted, ranks);
  for (const double r : ranks) out << (qel::mIsNumericMissing(r) ? "*" : formatNumber(r)) << '\n';
  return 0;
}

}  // namespace qelcalc
