// qelcalc maxmod crit|pvalue X --df D --lambdas L1,L2,... [--one-sided]
#ifndef QELCALC_MAXMOD_MODE_H
#define QELCALC_MAXMOD_MODE_H

#include <ostream>

namespace qelcalc {

int runMaxModMode(int argc, char** argv, std::ostream& out);
void printMaxModUsage(std::ostream& out);

}  // namespace qelcalc

#endif
