#include "test_input.h"

#include <fstream>
#include <iostream>
#include <limits>
#include <sstream>

namespace qelcalc {

qel::AlternativeHypothesis alternativeOf(const Arguments& args) {
  const auto it = args.options.find("alternative");
  if (it == args.options.end() || it->second == "two-sided") return qel::kAlternativeNotEqual;
  if (it->second == "less") return qel::kAlternativeLess;
  if (it->second == "greater") return qel::kAlternativeGreater;
  throw UsageError("--alternative must be less, greater or two-sided");
}

qel::IntervalType intervalOf(const Arguments& args, qel::AlternativeHypothesis alternative) {
  const auto it = args.options.find("interval");
  if (it == args.options.end()) {
    if (alternative == qel::kAlternativeGreater) return qel::kIntervalLowerBound;
    if (alternative == qel::kAlternativeLess) return qel::kIntervalUpperBound;
    return qel::kIntervalTwoSided;
  }
  if (it->second == "two-sided") return qel::kIntervalTwoSided;
  if (it->second == "lower") return qel::kIntervalLowerBound;
  if (it->second == "upper") return qel::kIntervalUpperBound;
  throw UsageError("--interval must be two-sided, lower or upper");
}

double numberOption(const Arguments& args, const std::string& name, double fallback) {
  const auto it = args.options.find(name);
  return it == args.options.end() ? fallback : parseNumber(it->second, "--" + name);
}

int columnOption(const Arguments& args, const std::string& name, int fallback) {
  const double c = numberOption(args, name, fallback);
  if (!(c >= 1 && c <= 1e6) || c != static_cast<int>(c)) {
    throw UsageError("--" + name + " must be a column number from 1");
  }
  return static_cast<int>(c);
}

void writeField(std::ostream& out, const std::string& name, double value) {
  out << name << " " << formatNumber(value) << "\n";
}

void checkCode(int code) {
  if (code == qel::qelOk) return;
  std::string reason;
  if (code == qel::qelFailDegenerateData) reason = " (a sample holds identical values)";
  if (code == qel::qelFailOutOfMemory) reason = " (out of memory)";
  if (code == qel::qelFailBadEnumValue) reason = " (bad interval type or alternative)";
  throw UsageError("the test failed with message code " + std::to_string(code) + reason);
}

namespace {

// The fields of a line of a CSV file (commas) or of a whitespace table.
std::vector<std::string> fieldsOf(const std::string& text) {
  std::vector<std::string> fields;
  std::stringstream s(text);
  std::string f;
  if (text.find(',') != std::string::npos) {
    while (std::getline(s, f, ',')) fields.push_back(f);
  } else {
    while (s >> f) fields.push_back(f);
  }
  for (auto& field : fields) {
    const auto a = field.find_first_not_of(" \t\r\"");
    const auto b = field.find_last_not_of(" \t\r\"");
    field = a == std::string::npos ? "" : field.substr(a, b - a + 1);
  }
  return fields;
}

bool isNumber(const std::string& text) {
  try {
    parseNumber(text, "");
    return true;
  } catch (const UsageError&) {
    return false;
  }
}

}  // namespace

std::vector<TableRow> readTableRows(const std::string& path) {
  std::ifstream file;
  std::istream* in = &openInput(path, file);
  std::vector<TableRow> rows;
  std::string text;
  int lineNumber = 0;
  while (readLine(*in, text)) {
    ++lineNumber;
    TableRow row{lineNumber, fieldsOf(text)};
    if (!row.fields.empty()) rows.push_back(std::move(row));
  }
  if (in->bad()) throw UsageError("error while reading '" + path + "'");
  return rows;
}

bool hasHeader(const std::vector<TableRow>& rows, const std::vector<int>& columns) {
  if (rows.empty()) return false;
  const auto& first = rows.front().fields;
  for (int c : columns) {
    if (static_cast<int>(first.size()) >= c && !first[c - 1].empty() && !isNumber(first[c - 1])) {
      return true;
    }
  }
  return false;
}

std::vector<double> tableColumn(const std::vector<TableRow>& rows, int column,
                                const std::string& path) {
  std::vector<double> values;
  for (std::size_t r = hasHeader(rows, {column}) ? 1 : 0; r < rows.size(); ++r) {
    const auto& fields = rows[r].fields;
    if (static_cast<int>(fields.size()) < column || fields[column - 1].empty()) continue;
    values.push_back(parseNumber(fields[column - 1], "line " + std::to_string(rows[r].lineNumber)));
  }
  if (values.empty()) {
    throw UsageError("no numbers in column " + std::to_string(column) + " of '" + path + "'");
  }
  if (values.size() > std::numeric_limits<unsigned int>::max()) {
    throw UsageError("too many numbers");
  }
  return values;
}

// Paired columns, paired by row: a row that lacks either value is dropped as
// a whole (pairing the columns' values separately would join values of
// different rows). Returns the number of rows dropped.
std::size_t pairedColumns(const std::vector<TableRow>& rows, int first, int second,
                          const std::string& path, std::vector<double>* x, std::vector<double>* y) {
  std::size_t dropped = 0;
  const auto present = [](const std::vector<std::string>& f, int c) {
    return static_cast<int>(f.size()) >= c &&
           f[c - 1].find_first_not_of(" \t") != std::string::npos;
  };
  for (std::size_t r = hasHeader(rows, {first, second}) ? 1 : 0; r < rows.size(); ++r) {
    const auto& fields = rows[r].fields;
    if (!present(fields, first) || !present(fields, second)) {
      ++dropped;
      continue;
    }
    const std::string where = "line " + std::to_string(rows[r].lineNumber);
    x->push_back(parseNumber(fields[first - 1], where));
    y->push_back(parseNumber(fields[second - 1], where));
  }
  if (x->empty()) throw UsageError("no complete pairs in " + quoted(path));
  return dropped;
}

std::vector<double> readTableColumn(const std::string& path, int column) {
  return tableColumn(readTableRows(path), column, path);
}

}  // namespace qelcalc
