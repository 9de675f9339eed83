#include "reference_data.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <sstream>

namespace qeltest {

std::vector<Row> loadReferenceData(const std::string& name, int textFields) {
  const std::string path = std::string(QEL_TEST_DATA_DIR) + "/" + name;
  std::ifstream in(path);
  std::vector<Row> rows;
  if (!in) {
    ADD_FAILURE() << "cannot open reference data " << path;
    return rows;
  }
  std::string line;
  int lineNumber = 0;
  while (std::getline(in, line)) {
    ++lineNumber;
    if (line.empty() || line[0] == '#') continue;
    Row row;
    row.line = lineNumber;
    std::stringstream fields(line);
    std::string field;
    int index = 0;
    while (std::getline(fields, field, ',')) {
      if (index++ < textFields) {
        row.text.push_back(field);
        continue;
      }
      char* end = nullptr;
      const double value = std::strtod(field.c_str(), &end);
      if (end == field.c_str() || *end != '\0') {
        ADD_FAILURE() << path << ":" << lineNumber << ": bad number '" << field << "'";
      }
      row.numbers.push_back(value);
    }
    rows.push_back(row);
  }
  if (rows.empty()) ADD_FAILURE() << "no rows in " << path;
  return rows;
}

double relativeError(double actual, double expected) {
  if (std::isnan(expected) || std::isnan(actual)) {
    return std::isnan(expected) && std::isnan(actual) ? 0.0 : INFINITY;
  }
  if (std::isinf(expected) || std::isinf(actual)) return actual == expected ? 0.0 : INFINITY;
  if (expected == 0.0) return std::fabs(actual);
  return std::fabs(actual - expected) / std::fabs(expected);
}

}  // namespace qeltest
