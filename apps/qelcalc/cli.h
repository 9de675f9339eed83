// Small command-line helpers shared by the modes of qelcalc.
#ifndef QELCALC_CLI_H
#define QELCALC_CLI_H

#include <fstream>
#include <istream>
#include <map>
#include <stdexcept>
#include <string>
#include <vector>

namespace qelcalc {

// A usage or input error: reported as one line on stderr, exit status 2.
struct UsageError : std::runtime_error {
  using std::runtime_error::runtime_error;
};

// Arguments split into positional words, "--name value" options and flags.
struct Arguments {
  std::vector<std::string> positional;
  std::map<std::string, std::string> options;
  std::vector<std::string> flags;
};

// flagNames lists the options that take no value (e.g. "upper").
Arguments parseArguments(int argc, char** argv, int first,
                         const std::vector<std::string>& flagNames);

// Parses a whole string as a finite or infinite double; anything else is a
// UsageError naming what.
double parseNumber(const std::string& text, const std::string& what);

// text for an error message: at most 60 bytes, control bytes as \xNN.
std::string quoted(const std::string& text);

// One line ended by LF, CR LF or a lone CR; false at the end of the input.
bool readLine(std::istream& in, std::string& line);

// Reads one number per line (blank lines skipped) from a file, or from
// standard input when path is "-".
std::vector<double> readNumbers(const std::string& path);

// The stream to read: the file at path, opened into file, or standard input
// for "-". An unreadable file is a UsageError.
std::istream& openInput(const std::string& path, std::ifstream& file);

// Formats a result in the shortest form that reads back to the same double,
// or with the fixed count of significant digits set by --digits; NaN as
// "NaN", infinities as "Inf" and "-Inf".
std::string formatNumber(double value);

// The count of significant digits for formatNumber, 1 to 17; 0 restores the
// shortest round-trip form.
void setSignificantDigits(int digits);

// Takes the global options (--digits N) out of argv, wherever they stand,
// and applies them; returns the new argc. A bad value is a UsageError.
int takeGlobalOptions(int argc, char** argv);

}  // namespace qelcalc

#endif
