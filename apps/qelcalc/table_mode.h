// qelcalc table FILE|- [--want chisq,fisher,kappa,...|all]
#ifndef QELCALC_TABLE_MODE_H
#define QELCALC_TABLE_MODE_H

#include <ostream>

namespace qelcalc {

int runTableMode(int argc, char** argv, std::ostream& out);
void printTableUsage(std::ostream& out);

}  // namespace qelcalc

#endif
