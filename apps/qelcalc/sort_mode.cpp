// sort mode: the rows of a CSV or whitespace table ordered by numeric key
// columns, the first key most significant, each ascending or (with a minus
// sign) descending. The sort is stable, so rows equal on every key keep
// their order. A header line stays on top; rows are written as read.
#include "sort_mode.h"

#include <cmath>
#include <sstream>
#include <string>
#include <vector>

#include "cli.h"
#include "proxies/SortTool.h"
#include "proxies/rows.h"
#include "test_input.h"

namespace qelcalc {

namespace {

struct Key {
  int column;  // from 1
  bool ascending;
};

std::vector<Key> keysOf(const Arguments& args) {
  if (!args.options.count("by")) throw UsageError("sort needs --by, e.g. --by 2,-3");
  std::vector<Key> keys;
  std::stringstream text(args.options.at("by"));
  std::string item;
  while (std::getline(text, item, ',')) {
    const double v = parseNumber(item, "--by");
    if (v != std::floor(v) || v == 0.0 || std::fabs(v) > 1e6)
      throw UsageError("--by takes column numbers from 1, minus for descending");
    keys.push_back({static_cast<int>(std::fabs(v)), v > 0.0});
  }
  if (keys.empty()) throw UsageError("--by needs at least one column");
  return keys;
}

// The key cells of a column; every data row must hold a number there.
std::vector<double> keyColumn(const std::vector<TableRow>& rows, std::size_t first, int column) {
  std::vector<double> values;
  for (std::size_t i = first; i < rows.size(); ++i) {
    const auto& f = rows[i].fields;
    if (static_cast<std::size_t>(column) > f.size() || f[column - 1].empty())
      throw UsageError("line " + std::to_string(rows[i].lineNumber) + " has no column " +
                       std::to_string(column));
    values.push_back(parseNumber(f[column - 1], "column " + std::to_string(column)));
  }
  return values;
}

}  // namespace

void printSortUsage(std::ostream& out) {
  out << "  qelcalc sort FILE --by 2,-3\n"
         "    The rows of a table by the key columns (first most significant; minus:\n"
         "    descending), stable: rows equal on every key keep their order.\n";
}

int runSortMode(int argc, char** argv, std::ostream& out) {
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (args.positional.size() != 1) throw UsageError("sort takes one FILE (or -)");
  for (const auto& o : args.options)
    if (o.first != "by") throw UsageError("sort has no option --" + o.first);
  const std::vector<Key> keys = keysOf(args);
  const std::vector<TableRow> rows = readTableRows(args.positional[0]);
  std::vector<int> columns;
  for (const Key& k : keys) columns.push_back(k.column);
  const std::size_t first = !rows.empty() && hasHeader(rows, columns) ? 1 : 0;
  const int n = static_cast<int>(rows.size() - first);

  // Least significant key first: each stable pass refines the last.
  qel::CmSortTool<double> tool;
  qel::CbRows all;
  all.mUseAllRows(n);
  for (std::size_t k = keys.size(); k-- > 0;) {
    tool.mSort(keyColumn(rows, first, keys[k].column), all, k + 1 == keys.size(),
               keys[k].ascending);
  }
  qel::CbRows order;
  tool.mGetSortedRowNumbers(order);

  std::ostringstream text;
  auto writeRow = [&](const TableRow& row) {
    for (std::size_t j = 0; j < row.fields.size(); ++j) text << (j ? "," : "") << row.fields[j];
    text << '\n';
  };
  if (first) writeRow(rows[0]);
  for (int i = 0; i < order.mGetRowCt(); ++i) writeRow(rows[first + order.mGetRow(i) - 1]);
  out << text.str();
  return 0;
}

}  // namespace qelcalc
