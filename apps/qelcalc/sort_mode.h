// qelcalc sort FILE --by 2,-3: the rows of a table in a stable multi-key
// order.
#ifndef QELCALC_SORT_MODE_H
#define QELCALC_SORT_MODE_H

#include <ostream>

namespace qelcalc {

int runSortMode(int argc, char** argv, std::ostream& out);
void printSortUsage(std::ostream& out);

}  // namespace qelcalc

#endif
