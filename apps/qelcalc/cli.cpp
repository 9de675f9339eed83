#include "cli.h"

#include <cerrno>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <sstream>

namespace qelcalc {

Arguments parseArguments(int argc, char** argv, int first,
                         const std::vector<std::string>& flagNames) {
  Arguments args;
  for (int i = first; i < argc; ++i) {
    const std::string word = argv[i];
    if (word.size() > 2 && word.compare(0, 2, "--") == 0) {
      const std::string name = word.substr(2);
      bool isFlag = false;
      for (const auto& f : flagNames) isFlag = isFlag || f == name;
      if (isFlag) {
        args.flags.push_back(name);
      } else {
        if (i + 1 >= argc) throw UsageError("option --" + name + " needs a value");
        args.options[name] = argv[++i];
      }
    } else {
      args.positional.push_back(word);
    }
  }
  return args;
}

// Longest piece of a bad input quoted in an error message.
constexpr std::size_t kQuotedLength = 60;

std::string quoted(const std::string& text) {
  std::string out = "'";
  for (std::size_t i = 0; i < text.size() && i < kQuotedLength; ++i) {
    const unsigned char c = static_cast<unsigned char>(text[i]);
    if (c < 0x20 || c == 0x7F) {
      char escaped[8];
      std::snprintf(escaped, sizeof escaped, "\\x%02X", c);
      out += escaped;
    } else {
      out += static_cast<char>(c);
    }
  }
  if (text.size() > kQuotedLength) out += "...";
  return out + "'";
}

// The whole text must be the number: a NUL byte inside it ends strtod's view
// of the string, not the line. A value beyond the double range is refused
// rather than read as an infinity.
double parseNumber(const std::string& text, const std::string& what) {
  const char* begin = text.c_str();
  const char* last = begin + text.size();
  char* end = nullptr;
  errno = 0;
  const double value = std::strtod(begin, &end);
  const bool overflow = errno == ERANGE && std::isinf(value);
  while (end != last && (*end == ' ' || *end == '\t' || *end == '\r')) ++end;
  if (text.empty() || end == begin || end != last || std::isnan(value)) {
    throw UsageError(what + ": not a number: " + quoted(text));
  }
  if (overflow) throw UsageError(what + ": beyond the double range: " + quoted(text));
  return value;
}

// Lines ended by LF, CR LF or a lone CR (old Mac files).
bool readLine(std::istream& in, std::string& line) {
  line.clear();
  int c;
  bool any = false;
  while ((c = in.get()) != EOF) {
    any = true;
    if (c == '\n') return true;
    if (c == '\r') {
      if (in.peek() == '\n') in.get();
      return true;
    }
    line += static_cast<char>(c);
  }
  return any;
}

std::istream& openInput(const std::string& path, std::ifstream& file) {
  if (path == "-") return std::cin;
  file.open(path);
  if (!file) throw UsageError("cannot read file '" + path + "'");
  return file;
}

std::vector<double> readNumbers(const std::string& path) {
  std::ifstream file;
  std::istream* in = &openInput(path, file);
  std::vector<double> values;
  std::string line;
  unsigned long lineNumber = 0;
  while (readLine(*in, line)) {
    ++lineNumber;
    if (line.find_first_not_of(" \t\r") == std::string::npos) continue;
    const auto start = line.find_first_not_of(" \t");
    values.push_back(parseNumber(line.substr(start), "line " + std::to_string(lineNumber)));
  }
  if (in->bad()) throw UsageError("error while reading '" + path + "'");
  if (values.empty()) throw UsageError("no numbers in the input " + quoted(path));
  return values;
}

namespace {

// 0: the shortest form that reads back to the same double.
int significantDigits = 0;

}  // namespace

void setSignificantDigits(int digits) {
  significantDigits = digits;
}

// std::to_chars without a precision gives the shortest text that parses back
// to exactly the same double (round-trip guarantee of the C++17 charconv
// rules), switching to exponent form where that is shorter.
std::string formatNumber(double value) {
  if (std::isnan(value)) return "NaN";
  if (std::isinf(value)) return value > 0 ? "Inf" : "-Inf";
  char buffer[64];
  const std::to_chars_result r = significantDigits > 0
                                     ? std::to_chars(buffer, buffer + sizeof buffer, value,
                                                     std::chars_format::general, significantDigits)
                                     : std::to_chars(buffer, buffer + sizeof buffer, value);
  return std::string(buffer, r.ptr);
}

int takeGlobalOptions(int argc, char** argv) {
  int kept = 1;
  for (int i = 1; i < argc; ++i) {
    if (std::string(argv[i]) != "--digits") {
      argv[kept++] = argv[i];
      continue;
    }
    if (i + 1 >= argc) throw UsageError("option --digits needs a value");
    const double d = parseNumber(argv[++i], "--digits");
    if (!(d >= 1 && d <= 17) || d != std::floor(d))
      throw UsageError("--digits: a whole number from 1 to 17, not " + quoted(argv[i]));
    setSignificantDigits(static_cast<int>(d));
  }
  argv[kept] = nullptr;
  return kept;
}

}  // namespace qelcalc
