// The exported distribution families as the sweep calls them: the table that
// tools/codegen/gen_distribution_api.py writes for qelcalc, read here with a
// saturating int conversion so that every grid value reaches int parameters.
#ifndef QEL_TESTS_HOSTILE_SWEEP_FAMILIES_H
#define QEL_TESTS_HOSTILE_SWEEP_FAMILIES_H

#include <qel/distributions.h>

#include <climits>
#include <cmath>
#include <functional>
#include <string>
#include <vector>

namespace hostile {

using Values = std::vector<double>;

inline int toInt(double value, const char*) {
  if (std::isnan(value)) return 0;
  if (value <= INT_MIN) return INT_MIN;
  if (value >= INT_MAX) return INT_MAX;
  return static_cast<int>(value);
}

struct Parameter {
  std::string name;
  double defaultValue;
};

struct Family {
  std::string name;
  std::vector<Parameter> parameters;
  std::function<double(double, const Values&)> pdf;
  std::function<double(double, const Values&, bool)> cdf;
  std::function<double(double, const Values&)> inv;
  std::function<void(double*, const double*, unsigned long, const Values&)> pdfArray;
  std::function<void(double*, const double*, unsigned long, const Values&, bool)> cdfArray;
  std::function<void(double*, const double*, unsigned long, const Values&)> invArray;
};

inline const std::vector<Family>& families() {
  static const std::vector<Family> table = {
#include "../../apps/qelcalc/families_table.inc"
  };
  return table;
}

}  // namespace hostile

#endif
