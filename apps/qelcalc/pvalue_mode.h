// qelcalc pvalue|crit FAMILY VALUE [--PARAM VALUE ...] [--alternative A]
#ifndef QELCALC_PVALUE_MODE_H
#define QELCALC_PVALUE_MODE_H

#include <ostream>

namespace qelcalc {

int runPValueMode(int argc, char** argv, std::ostream& out);
void printPValueUsage(std::ostream& out);

}  // namespace qelcalc

#endif
