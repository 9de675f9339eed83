// Loading of the committed reference data (written by the generators in
// tools/reference from mpmath) and relative-error helpers.
#ifndef QEL_TESTS_REFERENCE_DATA_H
#define QEL_TESTS_REFERENCE_DATA_H

#include <cmath>
#include <string>
#include <vector>

namespace qeltest {

// One row of a comma-separated data file: leading text fields and numbers.
struct Row {
  std::vector<std::string> text;
  std::vector<double> numbers;
  int line = 0;
};

// Reads tests/data/<name>; the first textFields fields of a row are kept as
// text and the rest parsed as doubles ("nan", "inf" and "-inf" allowed).
// Lines starting with '#' are comments. Fails the current test if the file
// is missing or malformed.
std::vector<Row> loadReferenceData(const std::string& name, int textFields);

// |actual - expected| / |expected|, or |actual| when expected is 0; 0 when
// both are NaN or the same infinity, infinity when only one of them is.
double relativeError(double actual, double expected);

}  // namespace qeltest

#endif
