// Options and table input shared by the test modes of qelcalc (ttest, the
// location tests and the rank tests of `qelcalc test`).
#ifndef QELCALC_TEST_INPUT_H
#define QELCALC_TEST_INPUT_H

#include <qel/basic_types.h>

#include <ostream>
#include <string>
#include <vector>

#include "cli.h"

namespace qelcalc {

// --alternative less|greater|two-sided (default two-sided).
qel::AlternativeHypothesis alternativeOf(const Arguments& args);

// --interval two-sided|lower|upper; without it the interval follows the
// alternative: a bound below for "greater", a bound above for "less".
qel::IntervalType intervalOf(const Arguments& args, qel::AlternativeHypothesis alternative);

// The value of --name as a number, or fallback when the option is absent.
double numberOption(const Arguments& args, const std::string& name, double fallback);

// The value of --name as a column number from 1, or fallback.
int columnOption(const Arguments& args, const std::string& name, int fallback);

// Writes "name value" with the value formatted by formatNumber.
void writeField(std::ostream& out, const std::string& name, double value);

// A non-zero message code of a test as a UsageError with a readable reason.
void checkCode(int code);

// The non-blank lines of a CSV file (commas) or whitespace table, split into
// trimmed fields; "-" reads standard input.
struct TableRow {
  int lineNumber;
  std::vector<std::string> fields;
};
std::vector<TableRow> readTableRows(const std::string& path);

// Whether the first row is a header: one of the given columns (from 1) holds
// a cell that is not a number.
bool hasHeader(const std::vector<TableRow>& rows, const std::vector<int>& columns);

// Column `column` (from 1) of a table; a first line that is not numeric
// there is a header, and empty cells are skipped (columns may differ in
// length). No numbers at all is an error naming the column and the file.
std::vector<double> tableColumn(const std::vector<TableRow>& rows, int column,
                                const std::string& path);

// readTableRows and tableColumn in one.
// Two columns paired by row; rows lacking either value are dropped and
// counted (the return value).
std::size_t pairedColumns(const std::vector<TableRow>& rows, int first, int second,
                          const std::string& path, std::vector<double>* x, std::vector<double>* y);

std::vector<double> readTableColumn(const std::string& path, int column);

}  // namespace qelcalc

#endif
