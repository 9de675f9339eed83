// qelcalc group FILE --by C[,C...] [--order natural|first|defined]
//   [--levels L[;L...]] [--all-combinations] [--value-column C] [--freq C]
//   [--indicators]
#ifndef QELCALC_GROUP_MODE_H
#define QELCALC_GROUP_MODE_H

#include <ostream>

namespace qelcalc {

int runGroupMode(int argc, char** argv, std::ostream& out);
void printGroupUsage(std::ostream& out);

}  // namespace qelcalc

#endif
