#include "cli.h"

#include <cerrno>
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

double parseNumber(const std::string& text, const std::string& what) {
  const char* begin = text.c_str();
  char* end = nullptr;
  errno = 0;
  const double value = std::strtod(begin, &end);
  while (end && (*end == ' ' || *end == '\t' || *end == '\r')) ++end;
  if (text.empty() || end == begin || *end != '\0' || std::isnan(value)) {
    throw UsageError(what + ": not a number: '" + text + "'");
  }
  return value;
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
  while (std::getline(*in, line)) {
    ++lineNumber;
    if (line.find_first_not_of(" \t\r") == std::string::npos) continue;
    const auto start = line.find_first_not_of(" \t");
    values.push_back(parseNumber(line.substr(start), "line " + std::to_string(lineNumber)));
  }
  if (in->bad()) throw UsageError("error while reading '" + path + "'");
  return values;
}

std::string formatNumber(double value) {
  if (std::isnan(value)) return "NaN";
  if (std::isinf(value)) return value > 0 ? "Inf" : "-Inf";
  char buffer[64];
  std::snprintf(buffer, sizeof buffer, "%.17g", value);
  return buffer;
}

}  // namespace qelcalc
