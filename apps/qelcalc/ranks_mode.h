// qelcalc ranks FILE [--descending] [--ties average|first]
#ifndef QELCALC_RANKS_MODE_H
#define QELCALC_RANKS_MODE_H

#include <ostream>

namespace qelcalc {

int runRanksMode(int argc, char** argv, std::ostream& out);
void printRanksUsage(std::ostream& out);

}  // namespace qelcalc

#endif
