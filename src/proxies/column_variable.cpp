// Column lengths of a list of columns.
#include "proxies/column_variable.h"

#include <algorithm>

namespace qel {

unsigned long mGetMaxRowCt(const std::vector<const std::vector<double>*>& columns) {
  unsigned long most = 0;
  for (const auto* column : columns) {
    if (column != nullptr) most = std::max(most, static_cast<unsigned long>(column->size()));
  }
  return most;
}

unsigned long mGetMaxRowCt(const std::vector<const CmColumnVar<double>*>& columns) {
  unsigned long most = 0;
  for (const auto* column : columns) {
    const std::vector<double>* data = column != nullptr ? column->mGetDataValues() : nullptr;
    if (data != nullptr) most = std::max(most, static_cast<unsigned long>(data->size()));
  }
  return most;
}

}  // namespace qel
