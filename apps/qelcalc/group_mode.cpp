// group mode: the groups of a table's rows by one or more columns, with each
// group's size (or total frequency) and the mean of a value column.
#include "group_mode.h"

#include <unistd.h>

#include <cmath>
#include <new>
#include <sstream>
#include <string>
#include <vector>

#include "cli.h"
#include "proxies/Frequencies.h"
#include "proxies/grouping.h"
#include "test_input.h"
#include "utilities/LYNBasicTypes.h"

namespace qelcalc {

namespace {

constexpr double kBytesPerGroup = 24.0;

std::vector<std::string> split(const std::string& text, char separator) {
  std::vector<std::string> parts;
  std::stringstream in(text);
  std::string part;
  while (std::getline(in, part, separator)) parts.push_back(part);
  if (!text.empty() && text.back() == separator) parts.emplace_back();
  return parts;
}

// A cell as a number: "*", an empty or an absent cell is the missing value.
double cellValue(const TableRow& row, int column) {
  if (static_cast<std::size_t>(column) > row.fields.size()) return qel::mGetMissingValueCode();
  const std::string& text = row.fields[static_cast<std::size_t>(column - 1)];
  if (text.empty() || text == "*") return qel::mGetMissingValueCode();
  return parseNumber(
      text, "line " + std::to_string(row.lineNumber) + " column " + std::to_string(column));
}

std::vector<int> columnList(const std::string& text) {
  std::vector<int> columns;
  for (const std::string& part : split(text, ',')) {
    const double v = parseNumber(part, "--by");
    if (!(v >= 1 && v <= 1e6) || v != std::floor(v))
      throw UsageError("--by: column numbers from 1, separated by commas");
    columns.push_back(static_cast<int>(v));
  }
  if (columns.empty()) throw UsageError("--by: at least one column");
  return columns;
}

std::string formatCell(double v) {
  return qel::mIsNumericMissing(v) ? std::string("*") : formatNumber(v);
}

// Half the physical memory: the most the empty groups of all combinations
// may take.
double memoryBudget() {
  const long pages = sysconf(_SC_PHYS_PAGES);
  const long size = sysconf(_SC_PAGE_SIZE);
  return pages > 0 && size > 0 ? 0.5 * static_cast<double>(pages) * static_cast<double>(size) : 1e9;
}

struct GroupInput {
  std::vector<std::vector<double>> by;
  std::vector<std::vector<double>> levels;
  std::vector<double> values, freq;
};

GroupInput readInput(const Arguments& args, const std::vector<int>& byColumns) {
  const std::string& path = args.positional[0];
  std::vector<TableRow> table = readTableRows(path);
  if (!table.empty() && hasHeader(table, byColumns)) table.erase(table.begin());
  const int valueColumn =
      args.options.count("value-column") ? columnOption(args, "value-column", 1) : 0;
  const int freqColumn = args.options.count("freq") ? columnOption(args, "freq", 1) : 0;
  GroupInput input;
  input.by.resize(byColumns.size());
  for (const TableRow& row : table) {
    for (std::size_t c = 0; c < byColumns.size(); ++c)
      input.by[c].push_back(cellValue(row, byColumns[c]));
    if (valueColumn > 0) input.values.push_back(cellValue(row, valueColumn));
    if (freqColumn > 0) {
      const double f = cellValue(row, freqColumn);
      if (!(f >= 0 && f <= 2147483647.0) && !qel::mIsNumericMissing(f))
        throw UsageError("--freq: frequencies are whole numbers from 0");
      input.freq.push_back(qel::mIsNumericMissing(f) ? 0.0 : f);
    }
  }
  if (table.empty()) throw UsageError("no rows in " + path);
  for (const int column : byColumns) {
    bool present = false;
    for (const TableRow& row : table) present = present || row.fields.size() >= std::size_t(column);
    if (!present) throw UsageError("column " + std::to_string(column) + " is beyond the table");
  }
  if (args.options.count("levels")) {
    for (const std::string& list : split(args.options.at("levels"), ';')) {
      input.levels.emplace_back();
      for (const std::string& level : split(list, ','))
        if (!level.empty()) input.levels.back().push_back(parseNumber(level, "--levels"));
    }
  }
  return input;
}

// Refuses all combinations whose empty groups would not fit in memory.
void checkCombinations(const std::vector<const qel::CmColumnVar<double>*>& columns) {
  double product = 1;
  for (const auto* column : columns) {
    qel::CmDistinctValues<double> distinct;
    distinct.mUseNaturalOrder();
    distinct.mFindDistinctValues(column);
    product *= distinct.mGetDistinctValueCt();
  }
  if (product * kBytesPerGroup > memoryBudget())
    throw UsageError("all combinations: " + formatNumber(product) + " groups do not fit in memory");
}

void writeGroups(const qel::CmGrouping<double>& grouping, const GroupInput& input,
                 std::ostream& out) {
  const qel::CmFrequencies frequencies(&input.freq);
  std::vector<double> values;
  std::vector<int> members;
  for (int g = 0; g < grouping.mGetNumberOfGroups(); ++g) {
    grouping.mGetValues(g, values);
    for (const double v : values) out << formatCell(v) << ' ';
    const int size = input.freq.empty() ? grouping.mGetGroupSize(g)
                                        : grouping.mGetGroupFrequency(g, frequencies, 0);
    out << size;
    if (!input.values.empty()) {
      // Weighted running mean, updated in place: no large partial sums.
      grouping.mGetRowsInGroup(g, members);
      double mean = 0, weight = 0;
      for (const int row : members) {
        const double x = input.values[static_cast<std::size_t>(row - 1)];
        const double w = input.freq.empty() ? 1.0 : frequencies.mGetRowFrequency(row - 1, 0);
        if (qel::mIsNumericMissing(x) || w <= 0) continue;
        weight += w;
        mean += (x - mean) * (w / weight);
      }
      out << ' ' << (weight > 0 ? formatNumber(mean) : std::string("NaN"));
    }
    out << '\n';
  }
}

}  // namespace

void printGroupUsage(std::ostream& out) {
  out << "  qelcalc group FILE --by C[,C...] [--order natural|first|defined]\n"
         "               [--levels L,L,..[;L,L,..]] [--all-combinations] [--value-column C]\n"
         "               [--freq C] [--indicators]\n"
         "    Groups the rows of a table (CSV or whitespace) by the --by columns: a line per\n"
         "    group with its values, its size (total frequency with --freq) and the mean of\n"
         "    the value column. '*' or an empty cell is a missing value, a group of its own.\n"
         "    --levels orders a column's values in defined order (';' between --by columns;\n"
         "    values not listed follow, ascending). --indicators prints \"row group\" lines.\n";
}

int runGroupMode(int argc, char** argv, std::ostream& out) {
  if (argc == 3 && std::string(argv[2]) == "--help") {
    printGroupUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {"all-combinations", "indicators"});
  if (args.positional.size() != 1) throw UsageError("group takes one FILE");
  for (const auto& option : args.options) {
    const std::string& name = option.first;
    if (name != "by" && name != "order" && name != "levels" && name != "value-column" &&
        name != "freq")
      throw UsageError("group has no option --" + name);
  }
  if (!args.options.count("by")) throw UsageError("group needs --by C[,C...]");
  const std::string order = args.options.count("order") ? args.options.at("order") : "natural";
  if (order != "natural" && order != "first" && order != "defined")
    throw UsageError("--order: natural, first or defined");
  if (args.options.count("levels") && order != "defined")
    throw UsageError("--levels goes with --order defined");
  bool all = false, indicators = false;
  for (const std::string& flag : args.flags) {
    all = all || flag == "all-combinations";
    indicators = indicators || flag == "indicators";
  }
  const GroupInput input = readInput(args, columnList(args.options.at("by")));
  std::vector<qel::CmColumnVar<double>> variables;
  for (std::size_t c = 0; c < input.by.size(); ++c) {
    variables.emplace_back(&input.by[c], qel::eNaturalSortOrder);
    if (order == "defined")
      variables.back().mSetSortOrder(c < input.levels.size() ? &input.levels[c] : nullptr);
  }
  std::vector<const qel::CmColumnVar<double>*> columns;
  for (const auto& variable : variables) columns.push_back(&variable);
  if (all) checkCombinations(columns);
  qel::CmGrouping<double> grouping;
  if (order == "natural") grouping.mUseNaturalOrder();
  if (order == "first") grouping.mUseFirstEncounteredOrder();
  try {
    if (grouping.mFindGrouping(columns, false, all, true) == 30023)
      throw UsageError("all combinations: more groups than 2147483647 (code 30023)");
  } catch (const std::bad_alloc&) {
    throw UsageError("not enough memory for the groups");
  }
  if (indicators) {
    std::vector<int> group;
    grouping.mGetGroupIndicators(group);
    for (std::size_t r = 0; r < group.size(); ++r) out << r + 1 << ' ' << group[r] << '\n';
    return 0;
  }
  writeGroups(grouping, input, out);
  return 0;
}

}  // namespace qelcalc
